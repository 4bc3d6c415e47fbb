// The library compares character by character: first what they are long, then their small letters; or, where the
// language has mappings of its own, the whole texts in capitals. What it does is asked of its comparison.
#include "folded_bytes.h"

#include <algorithm>
#include <cstring>

namespace lexicor_cli {

namespace {

// In keys, a byte from here on says how long the character behind it is; single bytes stand alone, or behind it.
constexpr uint8_t kLengthMark = 0xF8;

int32_t compare(const Codepage& codepage, char a, char b) {
  return LXStrcmp(codepage.locale(), &a, 1, &b, 1, LX_CASE_INSENSITIVE);
}

/// Whether letters are compared as capitals: seen in a character whose byte stands between them.
bool compares_capitals(const Codepage& codepage, bool* known) {
  const auto byte_of = [&](LXUChar unicode) {
    return static_cast<char>(LXCpUnicodeToCharW(codepage.object(), unicode));
  };
  const char small = byte_of('a'), capital = byte_of('A');
  const auto value = [](char c) { return static_cast<uint8_t>(c); };
  for (const char sign : {byte_of('_'), byte_of('~'), byte_of('^'), byte_of('[')}) {
    if ((value(sign) < value(small)) == (value(sign) < value(capital))) continue;
    *known = true;
    return (compare(codepage, sign, small) < 0) == (value(sign) < value(capital));
  }
  return false;
}

}  // namespace

FoldedBytes::FoldedBytes(const Codepage& codepage) : codepage_(codepage) {
  if (codepage.shift_sensitive()) return;
  upper_ = compares_capitals(codepage, &possible_);
  if (possible_ && !upper_) learn_single_bytes();
}

/// The comparison gives the difference of what two bytes are folded to.
void FoldedBytes::learn_single_bytes() {
  std::array<int32_t, 256> differences{};
  int32_t least = 0;
  const auto first = static_cast<char>(std::find_if(single_.begin(), single_.end(),
                                                    [&](const uint8_t& entry) {
                                                      const auto byte =
                                                          static_cast<char>(&entry - single_.data());
                                                      return codepage_.char_bytes(&byte, LX_SHIFT_SINGLE) == 1;
                                                    }) -
                                       single_.begin());
  for (size_t byte = 0; byte < single_.size(); ++byte) {
    const auto c = static_cast<char>(byte);
    if (codepage_.char_bytes(&c, LX_SHIFT_SINGLE) != 1) continue;
    differences[byte] = compare(codepage_, c, first);
    least = std::min(least, differences[byte]);
  }
  for (size_t byte = 0; byte < single_.size(); ++byte)
    single_[byte] = static_cast<uint8_t>(differences[byte] - least);
}

size_t FoldedBytes::write_key(std::string_view text, char* room) {
  if (upper_) {
    const int32_t bytes = LXMapString(codepage_.locale(), room, static_cast<int32_t>(key_room(text)),
                                      text.data(), static_cast<int32_t>(text.size()), LX_MAP_UPPER);
    return static_cast<size_t>(std::max(bytes, 0));
  }
  char* out = room;
  for (const char *at = text.data(), *const end = at + text.size(); at < end;) {
    const auto bytes = static_cast<size_t>(codepage_.char_bytes(at, LX_SHIFT_SINGLE));
    if (bytes == 1) {
      const uint8_t value = single_[static_cast<uint8_t>(*at++)];
      if (value >= kLengthMark) *out++ = static_cast<char>(kLengthMark);
      *out++ = static_cast<char>(value);
      continue;
    }
    const Char& c = fold(at, bytes);
    *out++ = static_cast<char>(kLengthMark + bytes - 1);
    std::memcpy(out, c.folded, sizeof c.folded);
    out += std::max<size_t>(bytes, c.bytes);
    at += bytes;
  }
  return static_cast<size_t>(out - room);
}

const FoldedBytes::Char& FoldedBytes::fold(const char* text, size_t bytes) {
  uint32_t code = 0;
  for (size_t i = 0; i < bytes; ++i) code = code << 8 | static_cast<uint8_t>(text[i]);
  Char& known = chars_[(code ^ code >> 8) % kRemembered];
  if (known.bytes != 0 && known.code == code) return known;
  known = {code, {}, 0};
  known.bytes = static_cast<uint8_t>(LXCpMbCaseConv(codepage_.object(), text, known.folded, LX_C1_UPPER));
  return known;
}

}  // namespace lexicor_cli
