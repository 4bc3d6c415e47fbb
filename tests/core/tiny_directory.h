// A directory with one object of every sort: English; UnitedStates, and Elsewhere with other separators and a
// currency that most codepages have not; the tiny codepages, and one in the old form; a sort.
#pragma once

#include "core/library_fixture.h"
#include "support/sort_builder.h"
#include "support/tiny_codepages.h"

namespace lx::test {

inline constexpr uint16_t kElsewhereId = 276, kOldId = 901, kSortId = 5;

inline void write_tiny_directory(const ScratchDirectory& directory) {
  std::vector<ScratchDirectory::Codepage> files = {{kOldId, "Old", version1_codepage(ascii_codepage()), 1}};
  for (const TinyCodepage& codepage : tiny_codepages()) files.push_back(codepage.file);
  std::sort(files.begin(), files.end(), [](const auto& a, const auto& b) { return a.id < b.id; });
  directory.write_locale(files);

  namespace territory = format::territory;
  const Bytes built_in = kBuiltInTerritory.sections.section[0];
  ByteString elsewhere(built_in.data, built_in.data + built_in.size);
  const uint16_t separators[] = {',', '.', ';', ',', 0xE0};
  for (size_t i = 0; i < std::size(separators); ++i) put_le16(elsewhere.data() + 2 * i, separators[i]);
  put_le16(elsewhere.data() + 2 * territory::kNumbers, 3);
  put_le16(elsewhere.data() + 2 * territory::kFlags, 0);
  put_le16(elsewhere.data() + le16(elsewhere.data() + 2 * 15), 0x3041);
  directory.write("te_00276.nls", object_file({elsewhere}));
  SortBuilder sort;
  for (LXUChar u = 'a'; u <= 'z'; ++u) {
    sort.characters[u].weights = {u, 1, 1, 0};
    sort.characters[static_cast<LXUChar>(u - 'a' + 'A')].weights = {u, 1, 2, 0};
  }
  sort.characters['z'].char_class = 7;  // not appended: comparison needs room for its levels
  directory.write("so_00005.nls", object_file({sort.payload()}));

  std::vector<ControlRecord> records{{1, LX_LANGUAGE, "English"},
                                     {kElsewhereId, LX_TERRITORY, "Elsewhere"},
                                     {840, LX_TERRITORY, "UnitedStates"}};
  for (const auto& file : files) records.push_back({file.id, LX_CODEPAGE, file.name});
  records.push_back({kSortId, LX_SORT, "Default"});
  directory.write("control.nls", control_file(records));
  directory.write_text("alias.txt", "TINY-UTF8 one two\nOld three\n");
}

/// A text in the units of another form, with its null.
template <class Unit>
std::basic_string<Unit> widened(const std::string& text) {
  return std::basic_string<Unit>(text.begin(), text.end());
}

}  // namespace lx::test
