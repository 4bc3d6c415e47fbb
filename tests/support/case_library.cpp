#include "support/case_library.h"

#include <cstring>
#include <stdexcept>

#include "codepage/lxunicode.h"
#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "core/lxobjtypes.h"
#include "lx.h"
#include "object_file.h"

namespace lx::test {

namespace {

namespace fmt = format::codepage;
namespace words = format::language;
namespace lands = format::territory;

/// Gives a codepage another pair of widths behind those that it has, which move to the end of the payload.
void add_pair(TinyCodepage* cp, const fmt::WidthPair& pair) {
  ByteString& payload = cp->file.sections[0];
  const uint8_t* const pairs = payload.data() + le16(payload.data() + fmt::kPairs);
  const uint16_t count = le16(payload.data() + fmt::kPairCount);
  const ByteString moved(pairs, pairs + size_t{count} * fmt::WidthPair::kBytes);
  put_le16(payload.data() + fmt::kPairs, static_cast<uint16_t>(payload.size()));
  put_le16(payload.data() + fmt::kPairCount, static_cast<uint16_t>(count + 1));
  payload.insert(payload.end(), moved.begin(), moved.end());
  lexicor_data::append_record(payload, pair);
}

void add_specials(ByteString* payload, size_t count, size_t table,
                  const std::vector<SpecialMapping>& specials) {
  put_le16(payload->data() + 2 * count, static_cast<uint16_t>(specials.size()));
  put_le16(payload->data() + 2 * table, static_cast<uint16_t>(payload->size()));
  for (const SpecialMapping& s : specials)
    for (const uint16_t u : {s.first, s.second, s.result1, s.result2}) {
      payload->resize(payload->size() + 2);
      put_le16(payload->data() + payload->size() - 2, u);
    }
}
ByteString special_language() {
  ByteString payload = payload_of(kBuiltInLanguage);
  add_specials(&payload, words::kUpperSpecials, words::kUpperSpecialTable, upper_specials());
  add_specials(&payload, words::kLowerSpecials, words::kLowerSpecialTable, lower_specials());
  return payload;
}
ByteString kana_language(bool long_names) {
  ByteString payload = payload_of(kBuiltInLanguage);
  for (unsigned word = words::kFirstDay; word < words::kLastText - 1; ++word) {
    uint8_t* const name = payload.data() + le16(payload.data() + 2 * word);
    if (le16(name) != 0) put_le16(name, static_cast<uint16_t>(0x3041 + word));
    if (long_names && word > words::kFirstDay && word < words::kFirstDay + 7) put_le16(name - 2, 'x');
  }
  if (long_names) put_le16(payload.data() + le16(payload.data() + 2 * words::kLastText), 'A');
  return payload;
}

ByteString elsewhere() {
  ByteString payload = payload_of(kBuiltInTerritory);
  const uint16_t separators[] = {',', '.', ';', ',', 0xE0};
  for (size_t i = 0; i < std::size(separators); ++i)
    put_le16(payload.data() + 2 * (lands::kSeparators + i), separators[i]);
  put_le16(payload.data() + 2 * lands::kNumbers, 3);
  put_le16(payload.data() + 2 * lands::kFlags, 0);
  put_le16(payload.data() + le16(payload.data() + 2 * (lands::kInternationalCurrency - 1)), 0x3041);
  return payload;
}

std::vector<TinyCodepage> with_common(std::vector<TinyCodepage> codepages) {
  codepages.push_back(tiny_codepages().back());
  return codepages;
}

/// Gives the characters of several bytes of a loaded codepage their other case.
void set_cases(const TinyCodepage& cp, LXLocale* in) {
  for (const TinyCharacter& c : cp.characters) {
    if (c.code <= 0xFF) continue;
    const uint16_t upper = unicode_upper(c.unicode);
    const TinyCharacter* const other = cp.find(upper != c.unicode ? upper : unicode_lower(c.unicode));
    auto* const record = const_cast<uint8_t*>(LXGetMbCtypeW(in->codepage, c.code));
    put_le32(record + 4, other != nullptr ? other->code - c.code : 0);
  }
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
    add_pair(&made.back(), {0x8141, '!'});
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

const std::vector<SpecialMapping>& upper_specials() {
  static const std::vector<SpecialMapping> specials{{0xDF, 0, 'S', 'S'},      {'i', 'j', 'A', 0},
                                                    {'q', 'q', 'R', 'Q'},     {'r', 0, 0x2603, 0},
                                                    {0x3042, 0, 'H', 0x3041}, {'h', 0x3043, 0x3044, 0}};
  return specials;
}
const std::vector<SpecialMapping>& lower_specials() {
  static const std::vector<SpecialMapping> specials{{'I', 'J', 'a', 'b'}, {'Q', 0, 0x3041, 0}};
  return specials;
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
  sort.computed = {{0x4E, {2, kAppendAll, 0x3000}},
                   {0x4F, {2, kAppendAll, 0x3100}},
                   {0x51, {2, 7, 0x3200}},
                   {0x20, {4, kAppendAll, 0x50}}};
  return sort;
}

CaseLibrary::CaseLibrary(const SortBuilder& sort)
    : TinyLibrary(with_common(case_codepages()), {{{2, LX_LANGUAGE, "Special"}, special_language()},
                                                  {{3, LX_LANGUAGE, "Kana"}, kana_language(false)},
                                                  {{4, LX_LANGUAGE, "Long"}, kana_language(true)},
                                                  {{276, LX_TERRITORY, "Elsewhere"}, elsewhere()},
                                                  {{1, LX_SORT, "Test"}, sort.payload()}}) {
  for (const TinyCodepage& codepage : case_codepages())
    if (codepage.width > 1) set_cases(codepage, locale(codepage));
}

}  // namespace lx::test
