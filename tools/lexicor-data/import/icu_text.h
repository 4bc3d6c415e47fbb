// What the importers of languages and territories share: ICU's errors and texts, and characters that every
// program is to get in the same plain form.
#pragma once

#include <unicode/utypes.h>

#include <memory>
#include <stdexcept>
#include <string>

namespace lexicor_import {

/// Throws for a failure of ICU.
inline void require(UErrorCode error, const char* what) {
  if (U_FAILURE(error)) throw std::runtime_error(std::string(what) + ": " + u_errorName(error));
}

/// The text that an ICU function writes: `fill(buffer, room, &error)` gives its length.
template <class Fill>
std::u16string icu_text(const char* what, Fill fill) {
  char16_t buffer[4096];
  UErrorCode error = U_ZERO_ERROR;
  const int32_t length = fill(buffer, static_cast<int32_t>(std::size(buffer)), &error);
  require(error, what);
  return std::u16string(buffer, static_cast<size_t>(length));
}

/// Closes a handle of ICU when its owner goes.
template <class Handle, void (*close)(Handle*)>
struct IcuCloser {
  void operator()(Handle* handle) const { close(handle); }
};
template <class Handle, void (*close)(Handle*)>
using IcuPtr = std::unique_ptr<Handle, IcuCloser<Handle, close>>;

/// A text without marks of direction, with its no-break spaces as spaces: few codepages hold these characters.
inline std::u16string plain(const std::u16string& text) {
  std::u16string out;
  for (char16_t unit : text) {
    if (unit == 0x200E || unit == 0x200F || unit == 0x061C) continue;
    out += unit == 0x00A0 || unit == 0x202F ? u' ' : unit;
  }
  return out;
}

/// As plain, with the minus sign and the apostrophe of typography as those of ASCII, for what a territory's
/// numbers and formats are made of.
inline std::u16string ascii_signs(const std::u16string& text) {
  std::u16string out = plain(text);
  for (char16_t& unit : out) unit = unit == 0x2212 ? u'-' : unit == 0x2019 ? u'\'' : unit;
  return out;
}

}  // namespace lexicor_import
