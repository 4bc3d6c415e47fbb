// Enumeration of a converter, and the corrections that stand in the table of codepages.
#include "codepage_import.h"

#include <algorithm>
#include <array>
#include <stdexcept>
#include <tuple>

#include "codepage_defaults.h"
#include "same_sign.h"

namespace lexicor_import {
namespace {

using lexicor_data::CodepageClass;
using lexicor_data::CodepageSource;
using lexicor_data::kShiftIn;
using lexicor_data::kShiftOut;
using lexicor_data::Mapping;

constexpr size_t kMaxCodeBytes = 4;
constexpr uint32_t kCodePoints = 0x110000;
constexpr size_t kRangeOfBytes = 2;  // where the dash stands in "F9-FC"
constexpr uint32_t kNone = 0xFFFFFFFF;
constexpr char kLowLetters[] = "low-letters";

/// A packed code with its length, as a key: codes of different lengths never meet.
struct Code {
  uint32_t packed = kNone;
  uint8_t bytes = 0;
  bool operator<(const Code& other) const {
    return std::tie(bytes, packed) < std::tie(other.bytes, other.packed);
  }
  bool operator==(const Code& other) const { return bytes == other.bytes && packed == other.packed; }
};

uint32_t first_byte(Code code) {
  return code.bytes == 0 ? kNone : code.packed >> (8 * (code.bytes - 1));
}

bool is_private(uint32_t unicode) {
  return unicode >= 0xE000 && unicode <= 0xF8FF;
}

Code pack(const Bytes& bytes) {
  Code code{0, static_cast<uint8_t>(bytes.size())};
  for (uint8_t byte : bytes) code.packed = code.packed << 8 | byte;
  return code;
}

class Import {
 public:
  Import(Converter& converter, Counts& left_out) : converter_(converter), left_out_(left_out) {}

  CodepageSource run(const Codepage& codepage) {
    source_.name = codepage.name;
    source_.source = converter_.description();
    source_.leads.fill(0);  // 0: not seen yet
    read_codes();
    read_code_points();
    set_family();
    const std::vector<std::string> overrides = words(codepage.overrides);
    const bool low_letters = std::count(overrides.begin(), overrides.end(), kLowLetters) != 0;
    if (source_.ascii && !low_letters) straighten_controls();
    for (const std::string& word : overrides) apply_override(word);
    drop_other_signs();
    set_substitution();
    set_line_ends();
    write_mappings();
    return std::move(source_);
  }

 private:
  void read_codes() {
    Bytes bytes;
    if (!converter_.is_shift_stateful()) {
      enumerate(bytes);
      for (uint32_t first = 0; first < 256; ++first) {
        if (source_.leads[first] == 0) source_.leads[first] = std::max<uint8_t>(longest_cut_[first], 1);
      }
      source_.width = *std::max_element(source_.leads.begin(), source_.leads.end());
      source_.kind = source_.width == 1 ? CodepageClass::kSingleByte : CodepageClass::kMultiByte;
      return;
    }
    source_.kind = CodepageClass::kShiftStateful;
    source_.width = 2;
    source_.leads.fill(1);
    for (uint32_t byte = 0; byte < 256; ++byte) {
      if (byte == kShiftOut || byte == kShiftIn) {
        ++left_out_["shift byte"];
        continue;
      }
      const Bytes code{static_cast<uint8_t>(byte)};
      add_code(code, code);
    }
    for (uint32_t pair = 0x100; pair < 0x10000; ++pair) {
      const auto lead = static_cast<uint8_t>(pair >> 8), trail = static_cast<uint8_t>(pair);
      if (lead == kShiftIn || lead == kShiftOut) continue;
      add_code({lead, trail}, {kShiftOut, lead, trail, kShiftIn});
    }
  }

  /// All characters that begin with `bytes`, which is empty or cut.
  void enumerate(Bytes& bytes) {
    if (bytes.size() == kMaxCodeBytes) throw std::runtime_error("characters of more than four bytes");
    bytes.push_back(0);
    for (uint32_t byte = 0; byte < 256; ++byte) {
      bytes.back() = static_cast<uint8_t>(byte);
      if (add_code(bytes, bytes) != Decoding::kCut) continue;
      uint8_t& longest = longest_cut_[bytes[0]];
      longest = std::max(longest, static_cast<uint8_t>(bytes.size() + 1));
      enumerate(bytes);
    }
    bytes.pop_back();
  }

  /// `text` is the code with its shift bytes.
  Decoding add_code(const Bytes& code, const Bytes& text) {
    uint32_t unicode = 0;
    const Decoding decoding = converter_.decode(text, unicode);
    if (decoding == Decoding::kSequence) ++left_out_["several code points"];
    if (decoding == Decoding::kCharacter) {
      to_unicode_[pack(code)] = unicode;
      if (!converter_.is_shift_stateful()) note_length(code);
    }
    return decoding;
  }

  void note_length(const Bytes& code) {
    uint8_t& length = source_.leads[code[0]];
    const auto bytes = static_cast<uint8_t>(code.size());
    if (length != 0 && length != bytes) throw std::runtime_error("a lead begins characters of two lengths");
    length = bytes;
  }

  void read_code_points() {
    // No codepage of one byte has characters beyond the first plane.
    const uint32_t end = source_.width == 1 ? 0x10000 : kCodePoints;
    for (uint32_t unicode = 0; unicode < end; ++unicode) {
      if (unicode >= 0xD800 && unicode <= 0xDFFF) continue;
      if (unicode == 0x40000) unicode = 0xF0000;  // no character stands in these planes
      Bytes bytes = converter_.encode(unicode);
      if (converter_.is_shift_stateful() && bytes.size() > 2 && bytes.front() == kShiftOut) {
        bytes.erase(bytes.begin());
        bytes.pop_back();
      }
      if (bytes.empty()) continue;
      if (converter_.is_shift_stateful() && bytes.size() == 1 &&
          (bytes[0] == kShiftOut || bytes[0] == kShiftIn)) {
        continue;
      }
      const size_t expected =
          converter_.is_shift_stateful() ? std::min<size_t>(bytes.size(), 2) : source_.leads[bytes[0]];
      if (bytes.size() != expected) {
        ++left_out_["length differs from the lead's"];
        continue;
      }
      from_unicode_[unicode] = pack(bytes);
    }
  }

  uint32_t value_of(uint32_t byte) const {
    const auto found = to_unicode_.find({byte, 1});
    return found == to_unicode_.end() ? kNone : found->second;
  }

  void set_family() {
    const std::optional<bool> ascii = lexicor_data::ascii_family(byte_of_);
    if (!ascii) throw std::runtime_error("neither ASCII-based nor EBCDIC");
    source_.ascii = *ascii;
  }

  void straighten_controls() {
    bool changed = false;
    for (uint32_t byte = 0; byte <= 0x7F; byte = byte == 0x1F ? 0x7F : byte + 1) {
      if (value_of(byte) == byte && byte_of_(byte) == byte) continue;
      to_unicode_[{byte, 1}] = byte;
      from_unicode_[byte] = {byte, 1};
      changed = true;
    }
    if (changed) source_.source += "; controls as in ASCII";
  }

  /// Of the mappings from Unicode alone, leaves those of the sign that the code reads as.
  void drop_other_signs() {
    for (auto at = from_unicode_.begin(); at != from_unicode_.end();) {
      const auto read = to_unicode_.find(at->second);
      const bool same = read != to_unicode_.end() && is_same_sign(at->first, read->second);
      at = same ? std::next(at) : from_unicode_.erase(at);
    }
  }

  void apply_override(const std::string& word) {
    source_.source += "; " + word;
    if (word == kLowLetters) return;
    if (word == "assigned") return read_as_assigned();
    const size_t sign = word.find_first_of("=>");
    if (sign == std::string::npos) throw std::runtime_error("override " + word + " says nothing");
    const std::string left = word.substr(0, sign), right = word.substr(sign + 1);
    const size_t dash = left.find('-');
    const uint32_t first = hex(left.substr(0, dash)), last = hex(left.substr(dash + 1));
    if (dash == kRangeOfBytes) {
      prefer(first, last, hex(right));
    } else if (word[sign] == '>') {
      const auto bytes = static_cast<uint8_t>(right.size() / 2);
      for (uint32_t unicode = first; unicode <= last; ++unicode)
        from_unicode_[unicode] = {hex(right) + unicode - first, bytes};
    } else {
      replace({first, static_cast<uint8_t>(left.size() / 2)}, right == "none" ? kNone : hex(right));
    }
  }

  static uint32_t hex(const std::string& digits) {
    return static_cast<uint32_t>(std::stoul(digits, nullptr, 16));
  }

  void prefer(uint32_t first, uint32_t last, uint32_t preferred) {
    for (const auto& [code, unicode] : to_unicode_) {
      const auto chosen = from_unicode_.find(unicode);
      if (first_byte(code) != preferred || chosen == from_unicode_.end()) continue;
      const uint32_t lead = first_byte(chosen->second);
      if (lead >= first && lead <= last) chosen->second = code;
    }
  }

  /// A code that reads as a private-use value, and as which a character is written, reads as this character.
  void read_as_assigned() {
    for (const auto& [unicode, code] : from_unicode_) {
      const auto read = to_unicode_.find(code);
      if (read != to_unicode_.end() && is_private(read->second) && !is_private(unicode)) read->second = unicode;
    }
  }

  /// Maps a code and a code point to each other, or the code to nothing.
  void replace(Code code, uint32_t unicode) {
    for (auto at = from_unicode_.begin(); at != from_unicode_.end();) {
      at = at->second == code ? from_unicode_.erase(at) : std::next(at);
    }
    to_unicode_.erase(code);
    if (unicode == kNone) return;
    to_unicode_[code] = unicode;
    from_unicode_[unicode] = code;
  }

  void set_substitution() {
    source_.substitution = source_.ascii ? 0x3F : 0x6F;
    if (value_of(source_.substitution) != '?' || byte_of_('?') != source_.substitution)
      throw std::runtime_error("the question mark is not that of its family");
  }

  void set_line_ends() {
    if (!byte_of_(0x0A) || !byte_of_(0x0D)) throw std::runtime_error("no line feed or carriage return");
    source_.line_ends = lexicor_data::usual_line_ends(source_.ascii, byte_of_);
  }

  void write_mappings() {
    auto add = [&](uint32_t unicode, Code code, uint8_t precision) {
      source_.mappings.push_back({unicode, code.packed, code.bytes, precision});
    };
    for (const auto& [unicode, code] : from_unicode_) {
      const auto back = to_unicode_.find(code);
      add(unicode, code, back != to_unicode_.end() && back->second == unicode ? 0 : 1);
    }
    for (const auto& [code, unicode] : to_unicode_) {
      const auto forth = from_unicode_.find(unicode);
      if (forth == from_unicode_.end() || !(forth->second == code)) add(unicode, code, 3);
    }
    std::sort(source_.mappings.begin(), source_.mappings.end(), lexicor_data::in_table_order);
  }

  Converter& converter_;
  Counts& left_out_;
  CodepageSource source_;
  std::array<uint8_t, 256>
      longest_cut_{};  ///< of leads that begin no assigned character: the length they announce
  std::map<Code, uint32_t> to_unicode_;
  std::map<uint32_t, Code> from_unicode_;
  const lexicor_data::ByteOf byte_of_ = [this](uint32_t unicode) -> std::optional<uint8_t> {
    const auto found = from_unicode_.find(unicode);
    if (found == from_unicode_.end() || found->second.bytes != 1) return std::nullopt;
    return static_cast<uint8_t>(found->second.packed);
  };
};

/// UTF-8 as the library computes it: 16-bit values, so its characters have up to three bytes.
CodepageSource computed_utf8(const Codepage& codepage) {
  CodepageSource source;
  source.name = codepage.name;
  source.source = "computed";
  source.kind = CodepageClass::kMultiByte;
  source.width = 3;
  source.utf8 = true;
  for (uint32_t lead = 0xC2; lead <= 0xEF; ++lead) source.leads[lead] = lead < 0xE0 ? 2 : 3;
  return source;
}

}  // namespace

CodepageSource import_codepage(const Codepage& codepage, Counts& left_out) {
  if (codepage.origin == kComputed) return computed_utf8(codepage);
  return Import(*open_converter(codepage), left_out).run(codepage);
}

}  // namespace lexicor_import
