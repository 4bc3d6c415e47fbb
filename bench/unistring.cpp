#include <unicase.h>
#include <unistr.h>
#include <unistring/version.h>

#include "icu.h"
#include "keep.h"

namespace bench::unistring {

std::string version() {
  return std::to_string(_libunistring_version >> 16) + "." + std::to_string(_libunistring_version >> 8 & 0xFF);
}

Work convert(const Input& input, const Encoding& from, const Encoding& to) {
  if (is_utf8(from) && is_utf16(to))
    return for_each_piece(input, [](const char* in, size_t bytes, char* out) {
      size_t units = bytes;
      const auto* const written =
          u8_to_u16(reinterpret_cast<const uint8_t*>(in), bytes, reinterpret_cast<uint16_t*>(out), &units);
      return written == nullptr ? 0 : 2 * units;
    });
  if (is_utf16(from) && is_utf8(to))
    return for_each_piece(input, [](const char* in, size_t bytes, char* out) {
      size_t room = 2 * bytes;
      const auto* const written =
          u16_to_u8(reinterpret_cast<const uint16_t*>(in), bytes / 2, reinterpret_cast<uint8_t*>(out), &room);
      return written == nullptr ? 0 : room;
    });
  return nullptr;
}

Work map(const Input& input, const Encoding& encoding, const char* language, bool is_upper) {
  if (is_utf8(encoding)) {
    const auto convert = is_upper ? u8_toupper : u8_tolower;
    return for_each_piece(input, [language, convert](const char* in, size_t bytes, char* out) {
      size_t room = 2 * bytes;
      const auto* const mapped = convert(reinterpret_cast<const uint8_t*>(in), bytes, language, nullptr,
                                         reinterpret_cast<uint8_t*>(out), &room);
      return mapped == nullptr ? 0 : room;
    });
  }
  if (is_utf16(encoding)) {
    const auto convert = is_upper ? u16_toupper : u16_tolower;
    return for_each_piece(input, [language, convert](const char* in, size_t bytes, char* out) {
      size_t room = bytes;
      const auto* const mapped = convert(reinterpret_cast<const uint16_t*>(in), bytes / 2, language, nullptr,
                                         reinterpret_cast<uint16_t*>(out), &room);
      return mapped == nullptr ? 0 : 2 * room;
    });
  }
  return nullptr;
}

Work count_chars(const Input& input, const Encoding& encoding) {
  if (!is_utf8(encoding)) return nullptr;
  return sum_of_pieces(input, [](const char* text, size_t bytes) {
    return u8_mbsnlen(reinterpret_cast<const uint8_t*>(text), bytes);
  });
}

Work walk(const Input& input, const Encoding& encoding) {
  if (!is_utf8(encoding)) return nullptr;
  return sum_of_pieces(input, [](const char* text, size_t bytes) {
    size_t chars = 0;
    ucs4_t codes = 0;
    for (size_t i = 0; i < bytes; ++chars) {
      ucs4_t c = 0;
      i += static_cast<size_t>(u8_mbtouc(&c, reinterpret_cast<const uint8_t*>(text) + i, bytes - i));
      codes += c;
    }
    keep(codes);
    return chars;
  });
}

}  // namespace bench::unistring
