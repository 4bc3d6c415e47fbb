// Keys are read where they stand; what they say together is settled when the mappings are known.
#include "ucm_header.h"

#include <algorithm>
#include <iterator>

#include "lexicor/hex.h"
#include "lexicor/near_names.h"
#include "line_text.h"
#include "ucm_classes.h"

namespace lexicor_data {
namespace {

using lexicor_cli::hex_text;

/// Keys that say something, and those of other systems that say nothing that the mappings do not.
constexpr const char* kKeys[] = {"code_set_name",     "base",
                                 "uconv_class",       "mb_cur_max",
                                 "subchar",           "subchar1",
                                 "lexicor:line_ends", "lexicor:leads",
                                 "lexicor:ascii",     "lexicor:algorithm",
                                 "lexicor:source",    "icu:base",
                                 "icu:state",         "icu:charsetFamily"};
constexpr const char* kIdleKeys[] = {"mb_cur_min", "char_name_mask", "code_set_alias"};
constexpr char kOwnKeys[] = "lexicor:", kForeignKeys[] = "icu:";

bool begins_with(const std::string& text, const char* beginning) {
  return text.rfind(beginning, 0) == 0;
}

template <size_t N>
bool is_one_of(const std::string& key, const char* const (&keys)[N]) {
  return std::find(std::begin(keys), std::end(keys), key) != std::end(keys);
}

}  // namespace

void UcmHeader::fail(const char* key, const std::string& what) const {
  const Position where = place_of(key);
  throw SourceError(file_, where.line, where.column, what);
}

Position UcmHeader::place_of(const char* key) const {
  const auto place = keys_.find(key);
  return place == keys_.end() ? end_ : place->second;
}

void UcmHeader::warn(Position where, const std::string& what) {
  source_.warnings.emplace_back(SourceError(file_, where.line, where.column, what).what());
}

void UcmHeader::read_key(UcmLine& line) {
  const Position start = line.here();
  const std::string key = line.bracketed();
  if (!is_one_of(key, kKeys)) return refuse_or_pass_over(key, start);
  const auto [entry, is_new] = keys_.emplace(key, start);
  if (!is_new && key != "icu:state")
    line.fail(start, "key <" + key + "> stands on line " + std::to_string(entry->second.line) + " already");
  line.skip_blanks();
  read_value(line, key);
  line.expect_end();
}

/// A key that nobody knows is one of another system's, unless it is nearly one that is read here.
void UcmHeader::refuse_or_pass_over(const std::string& key, Position start) {
  if (begins_with(key, kForeignKeys) || is_one_of(key, kIdleKeys)) return;
  std::vector<std::string> missing;
  std::copy_if(std::begin(kKeys), std::end(kKeys), std::back_inserter(missing),
               [&](const char* known) { return !has(known); });
  const std::string meant = lexicor_cli::nearest_name(key, missing);
  if (!meant.empty() || begins_with(key, kOwnKeys))
    throw SourceError(
        file_, start.line, start.column,
        "unknown key <" + key + ">" + (meant.empty() ? "" : lexicor_cli::did_you_mean("<" + meant + ">")));
  warn(start, "unknown key <" + key + "> is passed over");
}

void UcmHeader::read_value(UcmLine& line, const std::string& key) {
  const Position start = line.here();
  if (key == "code_set_name") {
    source_.name = line.quoted();
    if (source_.name.empty()) line.fail(start, "the name is empty");
  } else if (key == "base" || key == "icu:base") {
    base_ = line.quoted_or_word();
    if (base_.empty() || base_.find('/') != std::string::npos)
      line.fail(start, "expected the name of a codepage whose source stands beside this one");
  } else if (key == "uconv_class") {
    read_class(line);
  } else if (key == "mb_cur_max") {
    const char digit = line.peek();
    if (digit < '1' || digit > '4') line.fail_expected("a width from 1 to 4");
    line.take(digit);
    source_.width = static_cast<uint8_t>(digit - '0');
  } else if (key == "subchar") {
    read_substitution(line);
  } else if (key == "subchar1") {
    substitution_of_one_byte_ = line.byte();
  } else if (key == "lexicor:line_ends") {
    for (uint8_t& byte : source_.line_ends) byte = line.byte();
  } else if (key == "lexicor:ascii") {
    read_yes_or_no(line);
  } else if (key == "lexicor:leads") {
    read_leads(line);
  } else if (key == "lexicor:algorithm") {
    const std::string word = line.quoted();
    if (word != "UTF-8") line.fail(start, "found algorithm \"" + word + "\", expected \"UTF-8\"");
    source_.utf8 = true;
  } else if (key == "icu:state") {
    states_.read(line);
  } else if (key == "icu:charsetFamily") {
    family_ = line.quoted();
  } else {
    source_.source = line.quoted();
  }
}

void UcmHeader::read_class(UcmLine& line) {
  const Position start = line.here();
  const std::string word = line.quoted();
  for (const ClassWord& known : kClassWords) {
    if (word != known.text) continue;
    source_.kind = known.kind;
    return;
  }
  if (word == "DBCS")
    line.fail(start, "the class DBCS has no characters of one byte, which every codepage needs");
  line.fail(start, "found class \"" + word + "\", expected \"SBCS\", \"MBCS\" or \"EBCDIC_STATEFUL\"");
}

void UcmHeader::read_substitution(UcmLine& line) {
  source_.substitution = line.byte();
  for (substitution_bytes_ = 1; line.peek() == '\\'; ++substitution_bytes_) line.byte();
}

void UcmHeader::read_yes_or_no(UcmLine& line) {
  const Position start = line.here();
  const std::string word = line.word();
  if (word != "yes" && word != "no") line.fail(start, "found '" + word + "', expected yes or no");
  source_.ascii = word == "yes";
}

void UcmHeader::read_leads(UcmLine& line) {
  do {
    const Position start = line.here();
    const uint32_t first = line.hex_number(2, 2);
    const uint32_t last = line.take('-') ? line.hex_number(2, 2) : first;
    line.expect(':', "a colon and the length");
    const char digit = line.peek();
    if (digit < '2' || digit > '4') line.fail_expected("a length from 2 to 4");
    line.take(digit);
    if (last < first) line.fail(start, "the range runs backwards");
    if (first == 0) line.fail(start, "the byte 00 cannot begin a longer character");
    for (uint32_t byte = first; byte <= last; ++byte) {
      if (source_.leads[byte] != 1) line.fail(start, "lead " + hex_text(byte, 2) + " is named twice");
      source_.leads[byte] = static_cast<uint8_t>(digit - '0');
    }
    if (!line.done() && !is_blank(line.peek())) line.fail_expected("a blank between ranges");
    line.skip_blanks();
  } while (!line.done());
}

void UcmHeader::take_from(const CodepageSource& base) {
  const auto take = [&](const char* key, auto CodepageSource::*field) {
    if (!has(key)) source_.*field = base.*field, keys_.emplace(key, place_of("base"));
  };
  says_width_ = has("mb_cur_max");
  take("uconv_class", &CodepageSource::kind);
  take("mb_cur_max", &CodepageSource::width);
  take("subchar", &CodepageSource::substitution);
  take("lexicor:line_ends", &CodepageSource::line_ends);
  take("lexicor:ascii", &CodepageSource::ascii);
  leads_of_base_ = source_.kind == CodepageClass::kMultiByte && states_.empty() && !has("lexicor:leads");
  if (leads_of_base_) take("lexicor:leads", &CodepageSource::leads);
}

void UcmHeader::settle(SourceErrors& errors) {
  const ByteOf byte_of = [&](uint32_t unicode) -> std::optional<uint8_t> {
    for (const Mapping& m : source_.mappings)
      if (m.unicode == unicode && m.bytes == 1 && from_unicode(m)) return static_cast<uint8_t>(m.code);
    return std::nullopt;
  };
  for (const char* key : {"code_set_name", "mb_cur_max"})
    errors.attempt([&] {
      if (!has(key)) fail(key, "key <" + std::string(key) + "> is missing");
    });
  if (!errors.empty()) return;
  settle_class();
  settle_leads();
  if (!has("lexicor:ascii")) source_.ascii = ascii_family(byte_of).value_or(family_ != "EBCDIC");
  if (!has("lexicor:line_ends")) source_.line_ends = usual_line_ends(source_.ascii, byte_of);
  settle_substitution(byte_of);
  errors.attempt([&] { check_width(); });
  errors.attempt([&] { check_single("subchar", source_.substitution); });
  for (const uint8_t byte : source_.line_ends) errors.attempt([&] { check_single("lexicor:line_ends", byte); });
}

/// Other systems call a codepage of single bytes one of several bytes when it has a state table.
void UcmHeader::settle_class() {
  if (!has("uconv_class")) source_.kind = CodepageClass::kMultiByte;
  if (source_.width == 1 && source_.kind == CodepageClass::kMultiByte && !has("lexicor:leads"))
    source_.kind = CodepageClass::kSingleByte;
}

/// Leads follow from the state table, else from the first mapping of each. Those of a base hold, and bytes that begin
/// nothing there follow from the mappings.
void UcmHeader::settle_leads() {
  if (source_.kind != CodepageClass::kMultiByte || (has("lexicor:leads") && !leads_of_base_)) return;
  std::array<uint8_t, 256> seen{};
  for (const Mapping& m : source_.mappings) {
    uint8_t& length = seen[m.code >> 8 * (m.bytes - 1)];
    if (length == 0) length = m.bytes;
  }
  for (unsigned byte = 0; byte < 256; ++byte) {
    uint8_t said = states_.empty() ? 0 : states_.length(static_cast<uint8_t>(byte));
    if (leads_of_base_ && source_.leads[byte] > 1) said = source_.leads[byte];
    source_.leads[byte] = said != 0 ? said : std::max<uint8_t>(seen[byte], 1);
  }
  const uint8_t longest = *std::max_element(source_.leads.begin(), source_.leads.end());
  if (says_width_ && source_.width != longest)
    warn(place_of("mb_cur_max"), "width " + std::to_string(source_.width) +
                                     " is not that of the longest lead; " + std::to_string(longest) +
                                     " is taken instead");
  source_.width = longest;
}

/// A substitution of several bytes cannot be held.
void UcmHeader::settle_substitution(const ByteOf& byte_of) {
  if (has("subchar") && substitution_bytes_ == 1) return;
  constexpr uint8_t kSubstitute = 0x1A;
  const uint8_t question_mark = byte_of('?').value_or(source_.ascii ? kSubstitute : 0x6F);
  source_.substitution =
      substitution_of_one_byte_ < 0 ? question_mark : static_cast<uint8_t>(substitution_of_one_byte_);
  if (substitution_bytes_ > 1)
    warn(place_of("subchar"), "the substitution has " + std::to_string(substitution_bytes_) + " bytes; " +
                                  byte_text(source_.substitution) + " is taken instead");
}

void UcmHeader::check_width() const {
  const bool multi_byte = source_.kind == CodepageClass::kMultiByte;
  const std::string width = "width " + std::to_string(source_.width);
  if ((source_.kind == CodepageClass::kSingleByte) != (source_.width == 1))
    fail("mb_cur_max", width + " does not agree with the class");
  if (!multi_byte && has("lexicor:leads")) fail("lexicor:leads", "only the class MBCS has leads");
  const uint8_t longest = *std::max_element(source_.leads.begin(), source_.leads.end());
  if (multi_byte && longest != source_.width)
    fail("mb_cur_max", width + " is not that of the longest lead, " + std::to_string(longest));
  if (source_.utf8 && !multi_byte) fail("lexicor:algorithm", "the algorithm UTF-8 needs the class MBCS");
}

void UcmHeader::check_single(const char* key, uint8_t byte) const {
  const bool shift = source_.kind == CodepageClass::kShiftStateful && (byte == kShiftOut || byte == kShiftIn);
  if (shift || source_.leads[byte] != 1) fail(key, byte_text(byte) + " is no character of one byte");
}

}  // namespace lexicor_data
