// Each object that is named is loaded by itself first: locale creation does not tell an object's own data from
// the built-in data that take the place of a file that cannot be used.
#include "locale.h"

#include <algorithm>
#include <vector>

#include "session.h"

namespace lexicor_cli {

namespace {

// A name has at most 33 bytes, a locale name four of them.
constexpr size_t kNameBytes = 160;
constexpr char kUnknown[] = "Unknown";
constexpr const char* kListNames[] = {"languages", "territories", "codepages", "sorts"};

/// Why a part of a locale name cannot be used; an empty text when it can.
std::string problem_of(const LocalePart& part, int code) {
  if (code == LX_OK) return {};
  if (code == LX_E_NOT_FOUND) return std::string("there is no ") + part.title + " '" + part.name + "'";
  return std::string(part.title) + " " + part.name + " cannot be loaded: " + describe_code(code);
}

/// Throws a Failure for the first part that cannot be used; `not_found` is its exit code where there is no such
/// object.
void check_parts(const std::string& name, ExitCode not_found) {
  for (const LocalePart& part : LocaleName(name).parts) {
    const int code = load_part(part);
    if (code == LX_OK) continue;
    const std::string text = "no locale '" + name + "': " + problem_of(part, code);
    if (code != LX_E_NOT_FOUND) throw Failure(kDataError, text);
    throw Failure(not_found, text + " ('lexicor list " + kListNames[part.type] +
                                 "' shows those there are; a locale is named "
                                 "LANGUAGE[_TERRITORY][.CODEPAGE][@SORT])");
  }
}

LocalePtr opened(LXLocale* locale, int code, const std::string& name) {
  if (locale == nullptr)
    throw Failure(kDataError, "no locale '" + name + "': " + describe_code(code) +
                                  ", or a default of the language is not there");
  return LocalePtr(locale);
}

void append_utf8(std::string& text, LXUChar unit) {
  const unsigned value = unit;
  if (value < 0x80) {
    text += static_cast<char>(value);
  } else if (value < 0x800) {
    text += static_cast<char>(0xC0 | value >> 6);
    text += static_cast<char>(0x80 | (value & 0x3F));
  } else {
    text += static_cast<char>(0xE0 | value >> 12);
    text += static_cast<char>(0x80 | (value >> 6 & 0x3F));
    text += static_cast<char>(0x80 | (value & 0x3F));
  }
}

}  // namespace

LocaleName::LocaleName(const std::string& text)
    : parts{{LX_LANGUAGE, "language", ""},
            {LX_TERRITORY, "territory", ""},
            {LX_CODEPAGE, "codepage", ""},
            {LX_SORT, "sort", ""}} {
  struct {
    const char* mark;  // in front of the part
    const char* ends;
  } const kSyntax[] = {{"", "_.@"}, {"_", ".@"}, {".", "@"}, {"@", ""}};
  size_t at = 0;
  for (size_t i = 0; i < 4; ++i) {
    const std::string mark = kSyntax[i].mark;
    if (text.compare(at, mark.size(), mark) != 0 || at == text.size()) continue;
    at += mark.size();
    const size_t end = std::min(text.find_first_of(kSyntax[i].ends, at), text.size());
    parts[i].name = text.substr(at, end - at);
    at = end;
  }
}

int load_part(const LocalePart& part) {
  if (part.name.empty()) return LX_OK;
  int32_t code = LX_OK;
  LXGetObjFromName(nullptr, part.type, part.name.c_str(), static_cast<int32_t>(part.name.size()),
                   LX_FIND_AND_LOAD, &code);
  return code;
}

LocalePtr open_locale(const std::string& name) {
  check_parts(name, kUsageError);
  int32_t code = LX_OK;
  LXLocale* locale = LXGetLocale(name.c_str(), 0, &code);
  return opened(locale, code, name);
}

LocalePtr open_native_locale(const std::string& native_name) {
  const std::string name = map_native_name(native_name, kUsageError);
  check_parts(name, kDataError);
  int32_t code = LX_OK;
  LXLocale* locale = LXConvertNativeLocale(native_name.c_str(), 0, &code);
  return opened(locale, code, name);
}

LocalePtr open_user_locale(std::string* missing) {
  if (missing != nullptr) {
    char name[kNameBytes] = {};
    LXGetUserLocale(name, sizeof name - 1);
    if (name == std::string(kUnknown)) *missing = "the operating system's is not known";
    for (const LocalePart& part : LocaleName(name).parts) {
      const std::string problem = problem_of(part, load_part(part));
      if (missing->empty()) *missing = problem;
    }
  }
  int32_t code = LX_OK;
  LXLocale* locale = LXGetLocale(nullptr, LX_USER_LOCALE | LX_FALLBACK, &code);
  return opened(locale, code, "the user's");
}

LocalePtr open_chosen_locale(const std::string& name) {
  return name.empty() ? open_user_locale() : open_locale(name);
}

std::string map_native_name(const std::string& native_name, ExitCode unknown) {
  char name[kNameBytes];
  const std::string mapped = LXMapNativeLocale(native_name.c_str(), name, sizeof name);
  if (mapped == kUnknown)
    throw Failure(unknown, "unknown operating-system locale '" + native_name +
                               "'; 'lexicor list locales' shows those that are known");
  return mapped;
}

std::optional<int32_t> number_item(LXLocale* locale, int32_t item) {
  const int32_t value = LXGetLocaleNumInfo(locale, item, 0);
  if (value == -1) return std::nullopt;
  return value;
}

std::optional<std::string> text_item(LXLocale* locale, int32_t item) {
  // No text is longer than a section of an object file.
  std::vector<LXUChar> units(0x8000);
  const int32_t written =
      LXGetLocaleTextInfoU(locale, item, units.data(), static_cast<int32_t>(units.size()), 0);
  if (written <= 0) return std::nullopt;
  std::string text;
  units.resize(static_cast<size_t>(written) - 1);
  for (const LXUChar unit : units) append_utf8(text, unit);
  return text;
}

std::string language_territory(LXLocale* locale) {
  return text_item(locale, LX_ITEM_LANGUAGE).value_or("") + "_" +
         text_item(locale, LX_ITEM_TERRITORY).value_or("");
}

}  // namespace lexicor_cli
