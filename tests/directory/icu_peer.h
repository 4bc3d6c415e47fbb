// Texts of ICU, for tests that compare languages and territories with it.
#pragma once

#include <unicode/udat.h>
#include <unicode/unistr.h>
#include <unicode/ustring.h>

#include <string>

#include "import/icu_text.h"

namespace lx::test {

using Text16 = std::u16string;

/// The text of an ICU function that ends in buffer, room and error.
template <class Function, class... Arguments>
Text16 icu(Function function, Arguments... arguments) {
  return lexicor_import::icu_text("ICU", [&](UChar* out, int32_t room, UErrorCode* error) {
    return function(arguments..., out, room, error);
  });
}

inline std::string utf8(const Text16& text) {
  std::string out;
  return ::icu::UnicodeString(text.data(), static_cast<int32_t>(text.size())).toUTF8String(out);
}

/// ASCII, or 16-bit Unicode of another type.
template <class Text>
Text16 widen(const Text& text) {
  return Text16(text.begin(), text.end());
}

using DatePtr = lexicor_import::IcuPtr<UDateFormat, udat_close>;
inline DatePtr open_date(UDateFormatStyle time, UDateFormatStyle date, const std::string& locale,
                         const Text16& pattern = {}) {
  UErrorCode error = U_ZERO_ERROR;
  return DatePtr(udat_open(time, date, locale.c_str(), u"UTC", -1, pattern.data(),
                           static_cast<int32_t>(pattern.size()), &error));
}

inline Text16 formatted(const DatePtr& format, UDate milliseconds) {
  return icu([&](UChar* out, int32_t room, UErrorCode* status) {
    return udat_format(format.get(), milliseconds, out, room, nullptr, status);
  });
}

}  // namespace lx::test
