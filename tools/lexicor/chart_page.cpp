// Finds the pages of a codepage by its characters, and looks at each code of them.
#include "chart_page.h"

#include <memory>
#include <set>
#include <utility>

#include "character_values.h"
#include "hex.h"
#include "utf8_text.h"

namespace lexicor_cli {

namespace {

struct Word {
  uint32_t bit;
  const char* text;
};
constexpr Word kProperties[] = {{LX_C1_ALPHA, "ALPHA"}, {LX_C1_UPPER, "UPPER"},   {LX_C1_LOWER, "LOWER"},
                                {LX_C1_DIGIT, "DIGIT"}, {LX_C1_XDIGIT, "XDIGIT"}, {LX_C1_PUNCT, "PUNCT"},
                                {LX_C1_SPACE, "SPACE"}, {LX_C1_BLANK, "BLANK"},   {LX_C1_CNTRL, "CNTRL"},
                                {LX_C1_ASCII, "ASCII"}};
constexpr Word kText[] = {{LX_C3_NON_SPACING, "NON_SPACING"}, {LX_C3_DIACRITIC, "DIACRITIC"},
                          {LX_C3_VOWEL_MARK, "VOWEL_MARK"},   {LX_C3_SYMBOL, "SYMBOL"},
                          {LX_C3_KATAKANA, "KATAKANA"},       {LX_C3_HIRAGANA, "HIRAGANA"},
                          {LX_C3_HALF_WIDTH, "HALF_WIDTH"},   {LX_C3_FULL_WIDTH, "FULL_WIDTH"},
                          {LX_C3_IDEOGRAPH, "IDEOGRAPH"},     {LX_C3_KASHIDA, "KASHIDA"}};

std::string utf8(uint32_t c) {
  std::string text;
  append_utf8(text, c);
  return text;
}

/// Controls and blanks have pictures, marks a circle to stand on.
std::string sign_of(LXLocale* locale, LXUChar unicode) {
  constexpr uint32_t kPictures = 0x2400, kBlank = 0x2423, kDeletePicture = 0x2421, kControl = 0x25A1,
                     kCircle = 0x25CC;
  const uint32_t properties = LXGetCharTypeU(locale, unicode, LX_CTYPE1);
  if (unicode < 0x20) return utf8(kPictures + unicode);
  if (unicode == 0x7F) return utf8(kDeletePicture);
  // Controls, formats that would change what stands around them, surrogates and private characters.
  const bool is_format = (unicode >= 0x200B && unicode <= 0x200F) || (unicode >= 0x2028 && unicode <= 0x202E) ||
                         (unicode >= 0x2060 && unicode <= 0x206F) || unicode == 0xFEFF || unicode == 0xAD ||
                         unicode == 0x61C;
  if ((properties & LX_C1_CNTRL) != 0 || is_format || (unicode >= 0xD800 && unicode <= 0xF8FF))
    return utf8(kControl);
  if ((properties & LX_C1_SPACE) != 0 || unicode == 0xA0) return utf8(kBlank);
  const bool is_mark = (LXGetCharTypeU(locale, unicode, LX_CTYPE3) & LX_C3_NON_SPACING) != 0 &&
                       (LXGetCharTypeU(locale, unicode, LX_CTYPE2) & LX_C2_OTHER_NEUTRAL) != 0;
  return (is_mark ? utf8(kCircle) : "") + utf8(unicode);
}

/// What the codes of a codepage mean.
class Codes {
 public:
  explicit Codes(const Codepage& codepage) : codepage_(codepage), single_(single_byte_values(codepage)) {}

  LXUChar value(LXWChar code) const {
    return code > 0xFF       ? LXCpMbToUnicodeW(codepage_.object(), code)
           : is_single(code) ? single_[code]
                             : kReplacement;
  }
  bool is_single(LXWChar byte) const {
    const char text = static_cast<char>(byte);
    return !codepage_.is_shift(text) && codepage_.char_bytes(&text, LX_SHIFT_SINGLE) == 1;
  }
  const Codepage& codepage() const { return codepage_; }

 private:
  const Codepage& codepage_;
  const std::vector<LXUChar> single_;
};

/// Adds the leading bytes of the characters that begin with `lead` and have so many bytes behind it.
void add_leads(const Codepage& codepage, LXWChar lead, int32_t bytes_behind, std::set<LXWChar>* leads) {
  for (LXWChar byte = 0; byte < 256; ++byte) {
    const LXWChar code = lead << 8 | byte;
    if (bytes_behind > 1) {
      add_leads(codepage, code, bytes_behind - 1, leads);
    } else if (LXCpMbToUnicodeW(codepage.object(), code) != kReplacement) {
      leads->insert(lead);
      return;
    }
  }
}

/// The leading bytes of all characters. Those of UTF-8 are found by what can be written: a code that is ill-formed has a
/// value as well.
std::set<LXWChar> leads_of(const Codepage& codepage) {
  std::set<LXWChar> leads = {0};
  if (!codepage.utf8()) {
    for (LXWChar byte = 1; byte < 256; ++byte) {
      const char lead = static_cast<char>(byte);
      const int32_t bytes_behind = codepage.char_bytes(&lead, LX_SHIFT_DOUBLE) - 1;
      if (bytes_behind > 0 && !codepage.is_shift(lead)) add_leads(codepage, byte, bytes_behind, &leads);
    }
    return leads;
  }
  const Substitution substitution(codepage);
  for (uint32_t unicode = 0; unicode <= 0xFFFF; ++unicode) {
    const auto unit = static_cast<LXUChar>(unicode);
    const LXWChar code = LXCpUnicodeToCharW(codepage.object(), unit);
    if (code > 0xFF && !substitution.stands_for(unit, code)) leads.insert(code >> 8);
  }
  return leads;
}

ChartCell cell_of(const Codes& codes, const Codes* other, LXWChar code) {
  const Codepage& codepage = codes.codepage();
  ChartCell cell;
  cell.code = code;
  cell.unicode = codes.value(code);
  if (codepage.is_shift(static_cast<char>(code)) && code <= 0xFF) {
    cell.kind = ChartCell::Kind::kShift;
    cell.sign = "⇧";
  } else if (code <= 0xFF && !codes.is_single(code)) {
    cell.kind = ChartCell::Kind::kLead;
    cell.sign = "»";
  } else if (cell.unicode != kReplacement) {
    cell.kind = ChartCell::Kind::kCharacter;
    cell.sign = sign_of(codepage.locale(), cell.unicode);
    cell.properties = LXGetCharTypeW(codepage.locale(), code, LX_CTYPE1);
    cell.text = LXGetCharTypeW(codepage.locale(), code, LX_CTYPE3);
  }
  const LXUChar there = other != nullptr ? other->value(code) : cell.unicode;
  cell.differs = there != cell.unicode;
  if (cell.differs)
    cell.other =
        there == kReplacement ? "none" : code_point_name(there) + " " + sign_of(codepage.locale(), there);
  return cell;
}

}  // namespace

char ChartCell::letter() const {
  if (kind != Kind::kCharacter) return ' ';
  constexpr std::pair<uint32_t, char> kLetters[] = {{LX_C1_CNTRL, 'C'}, {LX_C1_SPACE, 'S'}, {LX_C1_UPPER, 'U'},
                                                    {LX_C1_LOWER, 'L'}, {LX_C1_ALPHA, 'A'}, {LX_C1_DIGIT, 'D'},
                                                    {LX_C1_PUNCT, 'P'}};
  for (const auto& [bit, letter] : kLetters) {
    if ((properties & bit) != 0) return letter;
  }
  return 'O';
}

std::string ChartCell::description() const {
  switch (kind) {
    case Kind::kLead:
      return "begins longer characters";
    case Kind::kShift:
      return "shift byte";
    case Kind::kNone:
      return "no character";
    default:
      break;
  }
  std::string words = code_point_name(unicode);
  for (const Word& word : kProperties)
    words += (properties & word.bit) != 0 ? std::string(" ") + word.text : "";
  for (const Word& word : kText) words += (text & word.bit) != 0 ? std::string(" ") + word.text : "";
  return words;
}

std::string ChartPage::title() const {
  if (lead == 0) return "Single bytes";
  std::string bytes;
  for (int shift = 24; shift >= 0; shift -= 8) {
    if (lead >> shift != 0) bytes += hex_text(lead >> shift & 0xFF, 2) + " ";
  }
  return "Bytes " + bytes + "xx";
}

std::vector<ChartPage> chart_pages(const Codepage& codepage, const Codepage* other) {
  const Codes codes(codepage);
  std::set<LXWChar> leads = leads_of(codepage);
  std::unique_ptr<Codes> other_codes;
  if (other != nullptr) {
    other_codes = std::make_unique<Codes>(*other);
    leads.merge(leads_of(*other));
  }
  std::vector<ChartPage> pages;
  for (const LXWChar lead : leads) {
    ChartPage& page = pages.emplace_back();
    page.lead = lead;
    for (LXWChar byte = 0; byte < 256; ++byte) {
      ChartCell& cell = page.cells[byte];
      cell = cell_of(codes, other_codes.get(), lead << 8 | byte);
      if (cell.differs) ++page.differences;
    }
  }
  return pages;
}

}  // namespace lexicor_cli
