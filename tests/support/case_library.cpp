#include "support/case_library.h"

#include <algorithm>
#include <stdexcept>

#include "codepage/lxunicode.h"
#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "core/lxobjtypes.h"
#include "lx.h"

namespace lx::test {

namespace {

namespace fmt = format::codepage;
namespace words = format::language;
namespace lands = format::territory;

void add_pair(TinyCodepage* cp, uint32_t half, uint32_t full) {
  ByteString& payload = cp->file.sections[0];
  const uint16_t count = le16(payload.data() + fmt::kPairCount);
  if (count == 0) put_le16(payload.data() + fmt::kPairs, static_cast<uint16_t>(payload.size()));
  put_le16(payload.data() + fmt::kPairCount, static_cast<uint16_t>(count + 1));
  payload.resize(payload.size() + fmt::WidthPair::kBytes);
  fmt::WidthPair{half, full}.write(payload.data() + payload.size() - fmt::WidthPair::kBytes);
}

/// Fills the width tables by the Unicode rule.
TinyCodepage with_widths(TinyCodepage cp) {
  const size_t table = le16(cp.file.sections[0].data() + fmt::kFullWidth);
  for (const TinyCharacter& c : cp.characters) {
    const TinyCharacter* const full = cp.find(unicode_half_to_full(c.unicode));
    if (full == nullptr || full->code == c.code || cp.width == 1) continue;
    if (c.code <= 0xFF)
      put_le32(cp.file.sections[0].data() + table + 4 * c.code, full->code);
    else
      add_pair(&cp, c.code, full->code);
  }
  return cp;
}

CodepageBuilder sjis(uint16_t id, const char* name) {
  CodepageBuilder builder(id, name, 2);
  builder.lead(0x81, 0x9F, 2).lead(0xE0, 0xFC, 2).ascii().map(0xA1, 0xFF61, 63).map(0x8140, 0x3000);
  builder.map(0x824F, 0xFF10, 10).map(0x8260, 0xFF21, 26).map(0x8281, 0xFF41, 26).map(0x829F, 0x3041, 83);
  builder.map(0x8340, 0x30A1, 63).map(0x8440, 0xFFE8, 7).map(0x84A0, 0x2502).map(0x889F, 0x4E9C);
  builder.map(0x898E, 0x5186).map(0xE0FC, 0x4EF0);
  return builder;
}

/// EBCDIC with two-byte characters; small letters where 930 has them, or where all others do.
TinyCodepage ebcdic(uint16_t id, const char* name, bool katakana) {
  CodepageBuilder builder(id, name, 2);
  builder.shift(0x0E, 0x0F).substitution(0x6F).map(0x00, 0x00, 4).map(0x25, 0x0A).map(0x40, ' ').map(0x6F, '?');
  builder.map(0x4B, '.').map(0x4D, '(').map(0x4E, '+').map(0x5A, '!').map(0x5B, '$').map(0x5D, ')').map(0x5E,
                                                                                                        ';');
  builder.map(0x60, '-').map(0x61, '/').map(0x6B, ',').map(0x6C, '%').map(0x6D, '_').map(0x7A, ':').map(0x7B,
                                                                                                        '#');
  builder.map(0x7D, '\'').map(0xC1, 'A', 9).map(0xD1, 'J', 9).map(0xE2, 'S', 8).map(0xF0, '0', 10);
  if (katakana)
    builder.map(0x62, 'a', 8).map(0x71, 'i', 8).map(0x8B, 'q').map(0x9B, 'r').map(0xAB, 's').map(0xB3, 't', 7);
  else
    builder.map(0x81, 'a', 9).map(0x91, 'j', 9).map(0xA2, 's', 8);
  builder.map(0x4040, 0x3000).map(0x4281, 0xFF41, 9).map(0x42C1, 0xFF21, 9).map(0x42F0, 0xFF10, 10);
  builder.map(0x4447, 0x3041, 83).map(0x4541, 0x4E9C, 3).map(0x4551, 0x5186);
  return with_widths(builder.build());
}

TinyCodepage utf8() {
  CodepageBuilder builder(fmt::kUtf8Id, "UTF8", 3);
  builder.ascii().lead(0xC0, 0xDF, 2).lead(0xE0, 0xFF, 3);
  builder.map(0xC2A0, 0xA0, 32).map(0xC380, 0xC0, 64).map(0xC480, 0x100, 64).map(0xCC80, 0x300, 16);
  builder.map(0xD9A0, 0x660, 10)
      .map(0xE28080, 0x2000)
      .map(0xE28090, 0x2010, 2)
      .map(0xE282AC, 0x20AC)
      .map(0xE29883, 0x2603);
  builder.map(0xE38080, 0x3000, 4)
      .map(0xE38181, 0x3041, 63)
      .map(0xE4B880, 0x4E00, 64)
      .map(0xE4BA80, 0x4E80, 64);
  builder.map(0xE4BC80, 0x4F00).map(0xE58686, 0x5186).map(0xEFBC90, 0xFF10, 10).map(0xEFBCA1, 0xFF21, 26);
  return with_widths(builder.map(0xEFBD81, 0xFF41, 26).map(0xEFBDA1, 0xFF61, 31).build());
}

ByteString built_in_language() {
  const Bytes built_in = kBuiltInLanguage.sections.section[0];
  return ByteString(built_in.data, built_in.data + built_in.size);
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
  ByteString payload = built_in_language();
  add_specials(&payload, words::kUpperSpecials, words::kUpperSpecialTable, upper_specials());
  add_specials(&payload, words::kLowerSpecials, words::kLowerSpecialTable, lower_specials());
  return payload;
}
ByteString kana_language(bool long_names) {
  ByteString payload = built_in_language();
  for (unsigned word = words::kFirstDay; word < words::kLastText - 1; ++word) {
    uint8_t* const name = payload.data() + le16(payload.data() + 2 * word);
    if (le16(name) != 0) put_le16(name, static_cast<uint16_t>(0x3041 + word));
    if (long_names && word > words::kFirstDay && word < words::kFirstDay + 7) put_le16(name - 2, 'x');
  }
  if (long_names) put_le16(payload.data() + le16(payload.data() + 2 * words::kLastText), 'A');
  return payload;
}

ByteString elsewhere() {
  const Bytes built_in = kBuiltInTerritory.sections.section[0];
  ByteString payload(built_in.data, built_in.data + built_in.size);
  const uint16_t separators[] = {',', '.', ';', ',', 0xE0};
  for (size_t i = 0; i < std::size(separators); ++i)
    put_le16(payload.data() + 2 * (lands::kSeparators + i), separators[i]);
  put_le16(payload.data() + 2 * lands::kNumbers, 3);
  put_le16(payload.data() + 2 * lands::kFlags, 0);
  put_le16(payload.data() + le16(payload.data() + 2 * (lands::kInternationalCurrency - 1)), 0x3041);
  return payload;
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
    std::vector<TinyCodepage> made{tiny_single(),
                                   with_widths(sjis(9002, "SJIS").build()),
                                   tiny_euc(),
                                   tiny_four(),
                                   ebcdic(9005, "SHIFT", false),
                                   utf8(),
                                   ebcdic(930, "K930", true),
                                   with_widths(sjis(9012, "ODD").build())};
    for (const auto& [place, name] : {std::pair(0, "SINGLE"), {2, "EUC"}, {3, "FOUR"}})
      made[static_cast<size_t>(place)].file.name = name;
    add_pair(&made.back(), 0x8141, '!');
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

CaseLibrary::CaseLibrary(const SortBuilder& sort) {
  const auto& codepages = case_codepages();
  std::vector<ScratchDirectory::Codepage> files{{fmt::kCommonId, "US-ASCII", ascii_codepage()}};
  for (const TinyCodepage& codepage : codepages) files.push_back(codepage.file);
  // The control file lists identifiers in ascending order.
  std::sort(files.begin(), files.end(), [](const auto& a, const auto& b) { return a.id < b.id; });
  directory_.write_locale(files);
  std::vector<ControlRecord> records{{1, LX_LANGUAGE, "English"},      {2, LX_LANGUAGE, "Special"},
                                     {3, LX_LANGUAGE, "Kana"},         {4, LX_LANGUAGE, "Long"},
                                     {276, LX_TERRITORY, "Elsewhere"}, {840, LX_TERRITORY, "UnitedStates"}};
  for (const auto& file : files) records.push_back({file.id, LX_CODEPAGE, file.name});
  records.push_back({1, LX_SORT, "Test"});
  directory_.write("control.nls", control_file(records));
  directory_.write("la_00002.nls", object_file({special_language()}));
  directory_.write("la_00003.nls", object_file({kana_language(false)}));
  directory_.write("la_00004.nls", object_file({kana_language(true)}));
  directory_.write("te_00276.nls", object_file({elsewhere()}));
  directory_.write("so_00001.nls", object_file({sort.payload()}));
  if (LXInit(directory_.path().c_str(), Hooks::allocate, Hooks::release, &hooks_, LX_NO_DEFAULTS) != LX_OK)
    throw std::runtime_error("LXInit failed");
  open_ = true;
  for (const TinyCodepage& codepage : codepages)
    if (codepage.width > 1) set_cases(codepage, locale(codepage));
}

bool CaseLibrary::close() {
  if (!open_) return true;
  open_ = false;
  bool good = true;
  for (const auto& [name, locale] : locales_) good &= LXReleaseLocale(locale) == LX_OK;
  good &= LXTerm() == LX_OK;
  return good && hooks_.live_blocks() == 0 && hooks_.wrong_frees() == 0;
}

LXLocale* CaseLibrary::new_locale(const TinyCodepage& codepage, const std::string& language,
                                  const std::string& sort) {
  const std::string name = language + "_UnitedStates." + codepage.file.name + (sort.empty() ? "" : "@" + sort);
  int32_t rc = LX_OK;
  LXLocale* const made = LXGetLocale(name.c_str(), 0, &rc);
  if (made == nullptr) throw std::runtime_error("no locale " + name + ": " + std::to_string(rc));
  return made;
}

LXLocale* CaseLibrary::locale(const TinyCodepage& codepage, const std::string& language,
                              const std::string& sort) {
  LXLocale*& kept = locales_[language + "." + codepage.file.name + "@" + sort];
  if (kept == nullptr) kept = new_locale(codepage, language, sort);
  return kept;
}

}  // namespace lx::test
