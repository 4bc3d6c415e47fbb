#include "small_files.h"

#include <algorithm>
#include <fstream>
#include <stdexcept>

#include "catalog_file.h"
#include "compile.h"
#include "language_toml.h"
#include "lx.h"
#include "support/case_library.h"
#include "support/damage.h"
#include "territory_toml.h"

namespace mutate {
namespace {

using namespace lx::test;
namespace fmt = lx::format::codepage;

constexpr uint16_t kLanguageId = 2, kTerritoryId = 276, kSortId = 5;

/// One and two bytes, with cases and widths.
CodepageBuilder two_bytes(uint16_t id, const char* name) {
  CodepageBuilder builder(id, name, 2);
  builder.ascii().lead(0x81, 0x83, 2).map(0xA1, 0xFF61, 63).map(0x8140, 0x3000);
  return builder.map(0x8260, 0xFF21, 26).map(0x8281, 0xFF41, 26).map(0x829F, 0x3041, 10);
}
CodepageBuilder three_bytes(uint16_t id) {
  CodepageBuilder builder(id, "THREE", 3);
  builder.ascii().lead(0x8E, 0x8E, 2).lead(0x8F, 0x8F, 3).map(0x8EA1, 0xFF61, 20);
  return builder.map(0x8FB0A1, 0x4E02).map(0x8FB0A2, 0x4E04, 2);
}
CodepageBuilder four_bytes(uint16_t id) {
  CodepageBuilder builder(id, "FOUR", 4);
  builder.ascii().lead(0x81, 0x81, 2).lead(0x90, 0x90, 4).map(0x8140, 0x4E02, 10);
  return builder.map(0x90308130, 0x0100, 10).map(0x90318130, 0x010A, 2);
}
CodepageBuilder shifted(uint16_t id) {
  CodepageBuilder builder(id, "SHIFT", 2);
  builder.shift(0x0E, 0x0F)
      .substitution(0x6F)
      .map(0x00, 0x00, 4)
      .text(0x25, "\n")
      .text(0x40, " ")
      .text(0x4B, ".");
  builder.text(0x4D, "(+").text(0x5A, "!$").text(0x5D, ");").text(0x60, "-/").text(0x6B, ",%_").text(0x6F, "?");
  builder.text(0x81, "abcdefghi").text(0xC1, "ABCDEFGHI").text(0xF0, "0123456789").map(0x4040, 0x3000);
  return builder.map(0x4281, 0xFF41, 9).map(0x42C1, 0xFF21, 9);
}
CodepageBuilder small_utf8() {
  CodepageBuilder builder(fmt::kUtf8Id, "UTF8", 3);
  builder.ascii().lead(0xC0, 0xDF, 2).lead(0xE0, 0xFF, 3);
  return builder.map(0xC380, 0xC0, 64).map(0xE38181, 0x3041, 63);
}

/// Of version 1, whose tries know no range of bytes: every first byte leads to one leaf of 256 characters.
ScratchDirectory::Codepage old_multibyte(uint16_t id) {
  CodepageBuilder builder(id, "OLD-MULTI", 2);
  builder.ascii().lead(0x82, 0x82, 2).map(0x8200, 0x3000, 0x100);
  return {id, "OLD-MULTI", version1_codepage(builder.build().file.sections), 1};
}

/// A page of the kind that has the two bytes of a code in two arrays.
ScratchDirectory::Codepage halves(uint16_t id) {
  ScratchDirectory::Codepage file = two_bytes(id, "HALVES").build().file;
  std::vector<ByteString>& s = file.sections;
  s.resize(lx::format::kMaxSections);
  uint8_t* const place = &s[0][fmt::kPages + 0x30 * fmt::PageEntry::kBytes];
  fmt::PageEntry page = fmt::PageEntry::read(place);
  const fmt::PageEntry words = page;
  page.kind = fmt::kKindByteByte;
  page.low = static_cast<uint16_t>(s[2].size());
  page.high = static_cast<uint16_t>(s[3].size());
  for (unsigned low = 0; low <= page.mask; ++low) {
    const uint32_t code = words.code(low, s[2].data(), s[3].data());
    s[2].push_back(static_cast<uint8_t>(code));
    s[3].push_back(static_cast<uint8_t>(code >> 8));
  }
  page.write(place);
  return file;
}

std::vector<ScratchDirectory::Codepage> small_codepages() {
  const ScratchDirectory::Codepage common = tiny_codepages().back().file;  // which names are read in
  const ScratchDirectory::Codepage single = tiny_single().file;
  return {common,
          {9001, "SINGLE", single.sections},
          two_bytes(9002, "TWO").build().file,
          three_bytes(9003).build().file,
          four_bytes(9004).build().file,
          shifted(9005).build().file,
          halves(9006),
          {9007, "OLD-SINGLE", version1_codepage(single.sections), 1},
          old_multibyte(9008),
          small_utf8().build().file};
}

ByteString territory() {
  const std::string name = LEXICOR_TESTS_DIR "/support/locale/elsewhere.toml";
  std::ifstream file(name);
  return pack_territory(lexicor_data::read_territory(file, name), name);
}

lexicor_gencat::Catalog catalog(lexicor_gencat::ByteOrder order) {
  return {
      std::string(kLanguageAndTerritory) + ".TWO@" + kSort,
      order,
      {{1, {{1, "one"}, {2, "two \x82\xA0"}, {3, ""}}}, {2, {{7, "seven"}}}, {9, {{1, "x"}, {900, "last"}}}}};
}

ByteString bytes_of(const std::string& text) {
  return ByteString(text.begin(), text.end());
}

/// UTF-8 has a type record for each of its characters, and so is five times larger than others.
constexpr size_t kUtf8Step = 11;

}  // namespace

SmallFiles::SmallFiles() {
  const ScratchDirectory directory;
  const std::vector<ScratchDirectory::Codepage> made = small_codepages();
  directory.write_locale(made,
                         {{{kLanguageId, LX_LANGUAGE, "Special"}, pack_language(special_language(), "special")},
                          {{kTerritoryId, LX_TERRITORY, "Elsewhere"}, territory()},
                          {{kSortId, LX_SORT, kSort}, example_sort().payload()}});
  const auto add = [&](const std::string& kind, const std::string& name, const std::string& codepage, Use use) {
    files_.push_back({kind, name, directory.read(name), codepage, use});
  };
  directory.write_text("alias.txt", "# aliases\nSINGLE one ISO\n two\nUTF8 utf8 u8\nTWO three\n");
  using lexicor_gencat::ByteOrder;
  const bool little = lexicor_gencat::native_byte_order() == ByteOrder::kLittle;
  directory.write("native.cat", bytes_of(pack_catalog(catalog(little ? ByteOrder::kLittle : ByteOrder::kBig))));
  directory.write("swapped.cat",
                  bytes_of(pack_catalog(catalog(little ? ByteOrder::kBig : ByteOrder::kLittle))));
  add("control", "control.nls", "", Use::kLocale);
  add("alias", "alias.txt", "", Use::kLocale);
  add("language", "la_00002.nls", "", Use::kLocale);
  add("territory", "te_00276.nls", "", Use::kLocale);
  add("sort", "so_00005.nls", "", Use::kSort);
  add("catalog", "native.cat", "TWO", Use::kCatalog);
  add("catalog of the other byte order", "swapped.cat", "TWO", Use::kCatalog);
  files_.back().big_endian = little;
  for (const ScratchDirectory::Codepage& codepage : made) {
    char name[20];
    snprintf(name, sizeof(name), "cp_%05d.nls", int{codepage.id});
    if (codepage.id == fmt::kCommonId) {
      others_.push_back({"", name, directory.read(name), "", Use::kLocale});
      continue;
    }
    add("codepage " + codepage.name, name, codepage.name, Use::kCodepage);
    codepages_.push_back(codepage.name);
    if (codepage.id == fmt::kUtf8Id) files_.back().step = kUtf8Step;
  }
  for (const char* name : {"la_00001.nls", "te_00840.nls"})
    others_.push_back({"", name, directory.read(name), "", Use::kLocale});
}

void SmallFiles::write(const ScratchDirectory& directory) const {
  for (const SmallFile& file : files_) directory.write(file.name, file.bytes);
  for (const SmallFile& file : others_) directory.write(file.name, file.bytes);
}

}  // namespace mutate
