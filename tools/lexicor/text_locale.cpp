// Places are counted in characters, of which each is one unit, and shown in columns of the terminal.
#include "text_locale.h"

#include <locale.h>
#include <wchar.h>

#include <algorithm>

#include "catalogue.h"
#include "locale.h"
#include "malformed.h"

namespace lexicor_cli {

namespace {

constexpr size_t kUtf8Growth = 3;

/// The columns of the first characters of a text: two of a wide character, none of a combining one.
size_t columns(const Units& text, size_t chars) {
  const locale_t widths = newlocale(LC_CTYPE_MASK, "C.UTF-8", nullptr);
  const locale_t before = widths != nullptr ? uselocale(widths) : nullptr;
  size_t columns = 0;
  for (size_t i = 0; i < chars; ++i) {
    const int width = i < text.size() ? wcwidth(static_cast<wchar_t>(text[i])) : 1;
    columns += width < 0 ? 1 : static_cast<size_t>(width);
  }
  if (widths != nullptr) {
    uselocale(before);
    freelocale(widths);
  }
  return columns;
}

/// A message, the text that it is about and a mark below a column of it.
Failure marked(ExitCode code, const std::string& message, std::string text, size_t column) {
  std::replace_if(
      text.begin(), text.end(), [](char c) { return c >= 0 && c < ' '; }, ' ');
  return Failure(code, message + "\n  " + text + "\n  " + std::string(column, ' ') + "^");
}

}  // namespace

TextLocale::TextLocale(const Session& session, const std::string& name)
    : utf8_(session, "UTF-8", language_territory(open_chosen_locale(name).get())) {}

Units TextLocale::units(const std::string& text) const {
  const Stretch stretch = MalformedFinder(utf8_, true).next(text.data(), text.size(), LX_SHIFT_SINGLE, true);
  const auto bytes = static_cast<int32_t>(stretch.good_bytes);
  Units units(stretch.good_bytes);
  const int32_t count =
      bytes == 0 ? 0 : LXStringToUnicode(units.data(), bytes, locale(), text.data(), bytes, 0);
  units.resize(static_cast<size_t>(std::max(count, 0)));
  if (stretch.end != Stretch::End::kText)
    throw marked(kDataError, "a character that is not UTF-8, or beyond U+FFFF", text,
                 columns(units, units.size()));
  return units;
}

std::string TextLocale::text(const Units& units, size_t count) const {
  std::string text(count * kUtf8Growth, '\0');
  const int32_t bytes = count == 0 ? 0
                                   : LXUnicodeToString(locale(), text.data(), static_cast<int32_t>(text.size()),
                                                       units.data(), static_cast<int32_t>(count), 0);
  text.resize(static_cast<size_t>(std::max(bytes, 0)));
  return text;
}

Failure TextLocale::pointing(ExitCode code, const std::string& message, const Units& units, size_t at) const {
  return marked(code, message, text(units, units.size()), columns(units, at));
}

}  // namespace lexicor_cli
