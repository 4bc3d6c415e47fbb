// A piece of text is turned into Unicode as a whole and its values are looked up in a bit set; only a piece
// that may have lost something is walked character by character.
#include "loss.h"

#include <algorithm>
#include <cstring>

#include "character_values.h"
#include "hex.h"

namespace lexicor_cli {

namespace {

/// The bytes at the end of the text that may be the first ones of a four-byte UTF-8 character.
size_t long_utf8_beginning(const std::string& text) {
  for (size_t bytes = 1; bytes < kLongUtf8Bytes && bytes <= text.size(); ++bytes) {
    const char c = text[text.size() - bytes];
    if (is_long_utf8_lead(c)) return bytes;
    if (!is_utf8_trail(c)) return 0;
  }
  return 0;
}

}  // namespace

LossFinder::LossFinder(const Codepage& source, const Codepage& target) : source_(source), target_(target) {
  find_lacking(target);
  replacement_ = LXCpUnicodeToCharW(source.object(), kReplacement);
  has_replacement_ = !Substitution(source).stands_for(kReplacement, replacement_);
}

void LossFinder::find_lacking(const Codepage& target) {
  const Substitution substitution(target);
  for (uint32_t unicode = 0; unicode < 0x10000; ++unicode) {
    const auto unit = static_cast<LXUChar>(unicode);
    lacking_[unicode] = substitution.stands_for(unit, LXCpUnicodeToCharW(target.object(), unit));
  }
}

void LossFinder::take(const char* data, size_t bytes) {
  text_.append(data, bytes);
  look_at(text_.size() - (source_.utf8() ? long_utf8_beginning(text_) : 0));
}

/// Looks at the whole characters in the first bytes of text_, and takes them off.
void LossFinder::look_at(size_t bytes) {
  if (bytes == 0) return;
  const auto length = static_cast<int32_t>(bytes);
  const LXShiftState state = state_;
  const char* const text = text_.data();
  const char* const end = LXMoveStringPointerEx(source_.locale(), text, state, length, &state_, 0);
  const auto whole = static_cast<int32_t>(end - text);
  units_.resize(bytes);
  const int32_t unit_count =
      LXStringToUnicodeEx(units_.data(), length, source_.locale(), text, state, whole, 0);

  uint64_t replacements = 0, lacking = 0;
  for (int32_t i = 0; i < unit_count; ++i) {
    const LXUChar unicode = units_[static_cast<size_t>(i)];
    if (unicode == kReplacement)
      ++replacements;
    else
      lacking += lacking_[unicode];
  }
  const bool own_encoding = is_own_encoding(text, whole, unit_count);
  // Without a character for U+FFFD every one of its values is a loss; no place is wanted beyond the first
  // losses.
  const bool counted = own_encoding && first_.size() == kReported && (replacements == 0 || !has_replacement_);
  if (counted)
    count_ += replacements + lacking;
  else if (!own_encoding || replacements + lacking > 0)
    look_at_chars(text, end, state);
  offset_ += static_cast<uint64_t>(whole);
  text_.erase(0, static_cast<size_t>(whole));
}

/// Whether UTF-8 text is what its Unicode values are encoded as: malformed characters are not. True of any
/// other codepage, where two characters may well have one Unicode value.
bool LossFinder::is_own_encoding(const char* text, int32_t bytes, int32_t unit_count) {
  if (!source_.utf8()) return true;
  encoded_.resize(static_cast<size_t>(unit_count) * 3 + 1);
  const int32_t encoded = LXUnicodeToString(
      source_.locale(), encoded_.data(), static_cast<int32_t>(encoded_.size()), units_.data(), unit_count, 0);
  return encoded == bytes && std::memcmp(encoded_.data(), text, static_cast<size_t>(bytes)) == 0;
}

void LossFinder::look_at_chars(const char* text, const char* end, LXShiftState state) {
  uint64_t offset = offset_;
  for (size_t i = 0; text < end; ++i) {
    if (source_.is_shift(*text)) {
      state = source_.state_after(*text++);
      ++offset;
      if (text == end) break;
    }
    const uint32_t code_point = source_.utf8() ? long_utf8_code_point(text, end) : 0;
    int32_t bytes = source_.char_bytes(text, state);
    if (code_point != 0) {
      record(offset, code_point_name(code_point) + ", which has no 16-bit Unicode value");
      bytes = kLongUtf8Bytes;
      i += kLongUtf8Bytes - 1;
    } else {
      LXWChar code = 0;
      for (int32_t k = 0; k < bytes; ++k) code = code << 8 | static_cast<unsigned char>(text[k]);
      const Kind kind = kind_of(code, units_[i]);
      if (kind != Kind::kNone) record(offset, describe(text, bytes, units_[i], kind));
    }
    text += bytes;
    offset += static_cast<uint64_t>(bytes);
  }
}

LossFinder::Kind LossFinder::kind_of(LXWChar code, LXUChar unicode) const {
  if (unicode == kReplacement && !(has_replacement_ && code == replacement_)) return Kind::kNoUnicode;
  if (source_.utf8() && LXCpUnicodeToCharW(source_.object(), unicode) != code) return Kind::kNoUnicode;
  return lacking_[unicode] ? Kind::kNotInTarget : Kind::kNone;
}

std::string LossFinder::describe(const char* text, int32_t bytes, LXUChar unicode, Kind kind) const {
  if (kind == Kind::kNotInTarget) return code_point_name(unicode) + ", which " + target_.name() + " lacks";
  return (bytes == 1 ? "byte " : "bytes ") + hex_bytes({text, static_cast<size_t>(bytes)}) +
         ", no character in " + source_.name();
}

void LossFinder::record(uint64_t offset, const std::string& message) {
  ++count_;
  if (first_.size() < kReported) first_.push_back({offset, message});
}

}  // namespace lexicor_cli
