// A directory with one object of every sort: English; UnitedStates, and Elsewhere with a currency that most
// codepages have not; the tiny codepages, and one in the old form; a sort.
#pragma once

#include "core/library_fixture.h"
#include "support/case_library.h"

namespace lx::test {

inline constexpr uint16_t kElsewhereId = 276, kOldId = 901, kSortId = 5;

inline void write_tiny_directory(const ScratchDirectory& directory) {
  std::vector<ScratchDirectory::Codepage> files = {{kOldId, "Old", version1_codepage(ascii_codepage()), 1}};
  for (const TinyCodepage& codepage : tiny_codepages()) files.push_back(codepage.file);
  ByteString elsewhere = payload_of(kBuiltInTerritory);
  const uint8_t* const currency = elsewhere.data() + 2 * (format::territory::kInternationalCurrency - 1);
  put_le16(elsewhere.data() + le16(currency), 0x3041);
  directory.write_locale(files, {{{kElsewhereId, LX_TERRITORY, "Elsewhere"}, elsewhere},
                                 {{kSortId, LX_SORT, "Default"}, example_sort().payload()}});
  directory.write_text("alias.txt", "TINY-UTF8 one two\nOld three\n");
}

/// A text in the units of another form, with its null.
template <class Unit>
std::basic_string<Unit> widened(const std::string& text) {
  return std::basic_string<Unit>(text.begin(), text.end());
}

}  // namespace lx::test
