#include "support/case_library.h"

#include <cstring>
#include <fstream>
#include <stdexcept>

#include "language_toml.h"
#include "support/damage.h"
#include "territory_toml.h"

namespace lx::test {

namespace {

namespace fmt = format::codepage;
using lexicor_data::LanguageSource;
using lexicor_data::SortPageKind;

/// A source beside this file.
template <class Source>
Source source_of(const std::string& name, Source (*read)(std::istream&, const std::string&)) {
  std::ifstream file(LEXICOR_TESTS_DIR "/support/locale/" + name);
  return read(file, name);
}
LanguageSource read_language(std::istream& in, const std::string& name) {
  using lexicor_data::ObjectType;
  return lexicor_data::read_language(
      in, name, {{{ObjectType::kTerritory, 840, "UnitedStates"}, {ObjectType::kCodepage, 367, "US-ASCII"}}});
}
ByteString language(const std::string& name) {
  return pack_language(source_of(name, read_language), name);
}

std::vector<TinyCodepage> with_common(std::vector<TinyCodepage> codepages) {
  codepages.push_back(tiny_codepages().back());
  return codepages;
}

}  // namespace

Units line_ends(const TinyCodepage& cp) {
  return cp.shift ? Units{0x0A, 2, 3, 1} : Units{0x0A, 0x0D, 0x0B, 0x0C};
}

const std::vector<TinyCodepage>& case_codepages() {
  static const std::vector<TinyCodepage> all = [] {
    std::vector<TinyCodepage> made = tiny_codepages();
    made.pop_back();  // US-ASCII
    for (TinyCodepage& cp : made) cp.file.name.erase(0, strlen("TINY-"));
    made.push_back(ebcdic(930, "K930", true));
    made.push_back(shift_jis(9012, "ODD"));
    // Another pair of widths, behind those that it has: all move to the end of the payload.
    change_sections(
        &made.back().file.sections,
        "0:size = @pair_count*8+size0+8; 0:size0 = @pairs:@pair_count*8 0x8141 0 0x21 0; 0:pairs = size0; "
        "0:pair_count = @pair_count+1");
    for (TinyCodepage& cp : made)
      for (size_t i = 0; i < 4; ++i)
        cp.file.sections[0][fmt::kLineEnds + i] = static_cast<uint8_t>(cp.find(line_ends(cp)[i])->code);
    return made;
  }();
  return all;
}

const TinyCodepage& case_codepage(const std::string& name) {
  for (const TinyCodepage& cp : case_codepages())
    if (cp.file.name == name) return cp;
  throw std::runtime_error("no codepage " + name);
}

const LanguageSource& special_language() {
  static const LanguageSource source = source_of("special.toml", read_language);
  return source;
}

TestWeight letter(uint16_t primary, uint8_t secondary, uint8_t tertiary, uint8_t char_class) {
  return {{primary, secondary, tertiary, 0}, char_class};
}
TestWeight special(uint16_t weight) {
  return {{0, 0, 0, weight}, kAppendAll};
}

SortBuilder example_sort() {
  SortBuilder sort;
  sort.characters = {{'a', letter(0x200)},
                     {'A', letter(0x200, 1, 2)},
                     {'b', letter(0x201)},
                     {'c', letter(0x202)},
                     {'h', letter(0x210)},
                     {'e', letter(0x208)},
                     {0x301, letter(0, 5, 1)},
                     {'-', special(7)},
                     {'+', special(9)},
                     {'y', letter(0x220, 1, 1, 7)},
                     {'z', letter(0x221, 1, 1, 7)},
                     {'1', letter(0x100, 2, 3, 8)},
                     {'2', letter(0x101, 4, 5, 8)},
                     {'s', letter(0x214)},
                     {'S', letter(0x214, 1, 2)},
                     {0xFF21, letter(0x200)}};
  sort.expansions = {{0xE6, {letter(0x200, 2, 1), {0x208, 1, 1, 0}}}};
  sort.pairs = {{'c', 'h', letter(0x203)}, {'c', 'h', letter(0x999)}};
  sort.computed = {{0x4E, {SortPageKind::kPrimary, 0x3000, kAppendAll, {}}},
                   {0x4F, {SortPageKind::kPrimary, 0x3100, kAppendAll, {}}},
                   {0x51, {SortPageKind::kPrimary, 0x3200, 7, {}}},
                   {0x20, {SortPageKind::kSpecial, 0x50, kAppendAll, {}}}};
  return sort;
}

SortBuilder sort_without_insertion() {
  SortBuilder sort = example_sort();
  for (const LXUChar inserted : units("yz12")) sort.characters.erase(inserted);
  sort.characters['x'] = letter(0x203);
  sort.characters[' '] = letter(0x100);
  return sort;
}

CaseLibrary::CaseLibrary(const SortBuilder& sort)
    : TinyLibrary(with_common(case_codepages()),
                  {{{2, LX_LANGUAGE, "Special"}, language("special.toml")},
                   {{3, LX_LANGUAGE, "Kana"}, language("kana.toml")},
                   {{4, LX_LANGUAGE, "Long"}, language("long.toml")},
                   {{276, LX_TERRITORY, "Elsewhere"},
                    pack_territory(source_of("elsewhere.toml", lexicor_data::read_territory), "Elsewhere")},
                   {{1, LX_SORT, "Test"}, sort.payload()},
                   {{2, LX_SORT, "Steady"}, sort_without_insertion().payload()}}) {}

}  // namespace lx::test
