// Each object that is named, and each that the language has for what is not, is loaded by itself first: locale creation
// does not tell an object's own data from the built-in data that take the place of a file that cannot be used.
#include "locale.h"

#include <algorithm>
#include <cctype>
#include <clocale>
#include <cstdlib>
#include <map>
#include <sstream>
#include <vector>

#include "catalogue.h"
#include "notices.h"
#include "session.h"
#include "utf8_text.h"

namespace lexicor_cli {

namespace {

// A name has at most 33 bytes, a locale name four of them.
constexpr size_t kNameBytes = 160;
constexpr const char* kListNames[] = {"languages", "territories", "codepages", "sorts"};

/// Why a part of a locale name cannot be used; an empty text when it can.
std::string problem_of(const LocalePart& part, int code) {
  if (code == LX_OK) return {};
  if (code == LX_E_NOT_FOUND) return std::string("there is no ") + part.title + " '" + part.name + "'";
  return load_problem(part.type, part.title, part.name, code);
}

/// The first object of a type that can be loaded, or the first of all, on built-in data. An object is loaded once: those
/// that cannot be are noted with why.
std::string first_usable(int type, std::map<std::string, int>* unusable) {
  const std::string first = first_name(type);
  const int first_code = load_part({type, "", first});
  if (first_code == LX_OK) return first;
  (*unusable)[first] = first_code;
  for (const CatalogueObject& object : read_catalogue().objects) {
    if (object.type != type || object.name == first) continue;
    const int code = load_part({type, "", object.name});
    if (code == LX_OK) return object.name;
    (*unusable)[object.name] = code;
  }
  return first;
}

/// Why a part that a locale name leaves out, and that the language says then, cannot be used; an empty text when all
/// can. The parts that are named can be used.
std::string problem_of_defaults(const std::string& name) {
  LocaleName parts(name);
  constexpr int32_t kDefaults[] = {LX_ITEM_DEFAULT_TERRITORY, LX_ITEM_DEFAULT_CODEPAGE, LX_ITEM_DEFAULT_SORT};
  const auto named = [](const LocalePart& part) { return !part.name.empty(); };
  if (std::all_of(std::begin(parts.parts), std::end(parts.parts), named)) return {};
  std::map<std::string, int> unusable;
  // What the language says is read from a locale that needs none of it.
  const std::string territory = first_usable(LX_TERRITORY, &unusable);
  const std::string codepage = first_usable(LX_CODEPAGE, &unusable);
  const std::string other = parts.parts[LX_LANGUAGE].name + "_" + territory + "." + codepage + "@BINARY";
  const LocalePtr locale(LXGetLocale(other.c_str(), 0, nullptr));
  for (const int32_t item : kDefaults) {
    LocalePart& part = parts.parts[LX_TERRITORY + (item - kDefaults[0])];
    if (named(part) || locale == nullptr) continue;
    part.name = text_item(locale.get(), item).value_or("");
    const auto found = unusable.find(part.name);
    const std::string problem = problem_of(part, found != unusable.end() ? found->second : load_part(part));
    if (!problem.empty()) return problem;
  }
  return {};
}

/// Throws a Failure for the first part that cannot be used; `not_found` is its exit code where there is no such
/// object.
void check_parts(const std::string& name, ExitCode not_found) {
  const std::string begin = "no locale '" + name + "': ";
  for (const LocalePart& part : LocaleName(name).parts) {
    const int code = load_part(part);
    if (code == LX_OK) continue;
    const std::string text = begin + problem_of(part, code);
    if (code != LX_E_NOT_FOUND) throw Failure(kDataError, text);
    throw Failure(not_found, text + " ('lexicor list " + kListNames[part.type] +
                                 "' shows those there are; a locale is named "
                                 "LANGUAGE[_TERRITORY][.CODEPAGE][@SORT])");
  }
  const std::string problem = problem_of_defaults(name);
  if (!problem.empty()) throw Failure(kDataError, begin + problem);
}

LocalePtr opened(LXLocale* locale, int code, const std::string& name) {
  if (locale == nullptr)
    throw Failure(kDataError, "no locale '" + name + "': a default of its language is not there (code " +
                                  std::to_string(code) + ")");
  return LocalePtr(locale);
}

/// The codeset of an operating-system name as the system's library compares it: its letters small, its digits,
/// and "iso" in front of digits alone. Language, territory and modifier stay.
std::string normalized(const std::string& native_name) {
  const size_t dot = std::min(native_name.find('.'), native_name.size());
  const size_t end = std::min(native_name.find('@', dot), native_name.size());
  std::string codeset;
  bool letters = false;
  for (size_t i = dot; i < end; ++i) {
    const auto c = static_cast<unsigned char>(native_name[i]);
    if (c >= 0x80 || std::isalnum(c) == 0) continue;
    letters |= std::isalpha(c) != 0;
    codeset += static_cast<char>(std::tolower(c));
  }
  if (codeset.empty()) return native_name.substr(0, dot) + native_name.substr(end);
  return native_name.substr(0, dot) + (letters ? "." : ".iso") + codeset + native_name.substr(end);
}

/// The library's own spelling of an operating-system name, or an empty text where it knows none. Of C.UTF-8 it
/// is C: the program takes text in UTF-8 anyway.
std::string known_native_name(const std::string& name) {
  struct Search {
    std::string normalized, found;
  } search{normalized(name), ""};
  for (const char* plain : {"C", "POSIX"})
    if (search.normalized == plain + std::string(".utf8")) return plain;
  LXEnumNativeLocales(
      [](void* user, const char* native, const char*) {
        Search& wanted = *static_cast<Search*>(user);
        if (normalized(native) == wanted.normalized) wanted.found = native;
        return static_cast<int32_t>(wanted.found.empty());
      },
      &search);
  return search.found;
}

/// The same of a name that may be composed of one for each category, "LC_CTYPE=de_DE.UTF-8;...". There a
/// category that is not known stays as it is.
std::string known_native_names(const std::string& name) {
  if (name.find(';') == std::string::npos) return known_native_name(name);
  std::string known;
  std::istringstream categories(name);
  for (std::string category; std::getline(categories, category, ';');) {
    const size_t value = category.find('=') + 1;
    const std::string found = known_native_name(category.substr(value));
    known += category.substr(0, value) + (found.empty() ? category.substr(value) : found) + ";";
  }
  if (name.back() != ';') known.pop_back();
  return known;
}

/// Whether a name is one of the operating system: no language has such a name.
bool is_native(const std::string& name) {
  return load_part(LocaleName(name).parts[LX_LANGUAGE]) == LX_E_NOT_FOUND && !known_native_names(name).empty();
}

/// The name of the locale that the environment asks for, by the rules of LXGetUserLocale.
std::string environment_locale() {
  const std::string before = setlocale(LC_ALL, nullptr);
  const char* const adopted = setlocale(LC_ALL, "");
  const std::string name = adopted != nullptr ? adopted : "";
  setlocale(LC_ALL, before.c_str());
  if (!name.empty()) return name;
  for (const char* variable : {"LC_ALL", "LANG"}) {
    const char* const value = secure_getenv(variable);
    if (value != nullptr && *value != '\0') return value;
  }
  return "C";
}

/// The first part of a locale name that cannot be used; an empty text when all can.
std::string first_problem(const std::string& name) {
  for (const LocalePart& part : LocaleName(name).parts) {
    const std::string problem = problem_of(part, load_part(part));
    if (!problem.empty()) return problem;
  }
  return problem_of_defaults(name);
}

LocalePtr open_user_locale() {
  const char* const variable = secure_getenv("LX_LANG");
  std::string name, problem;
  LXLocale* locale = nullptr;
  int32_t code = LX_OK;
  if (variable != nullptr) {
    name = variable;
    problem = first_problem(name);
    if (!problem.empty()) problem = "LX_LANG=" + name + ": " + problem;
    locale = LXGetLocale(nullptr, LX_USER_LOCALE | LX_FALLBACK, &code);
  } else {
    const std::string asked = environment_locale();
    const std::string native = known_native_names(asked);
    if (!native.empty()) name = map_native_name(native, kDataError);
    problem = native.empty() ? "it is not known" : first_problem(name);
    if (!problem.empty()) problem = "the operating system's locale " + asked + ": " + problem;
    locale = native.empty() ? LXGetLocale(nullptr, LX_USER_LOCALE | LX_FALLBACK, &code)
                            : LXConvertNativeLocale(native.c_str(), LX_FALLBACK, &code);
  }
  LocalePtr user = opened(locale, code, name.empty() ? "English" : name);
  if (!problem.empty())
    notices() << g_program << ": " << problem << "; "
              << text_item(user.get(), LX_ITEM_LOCALE_STRING).value_or("") << " is used instead\n";
  return user;
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
  LXLocale* locale = LXConvertNativeLocale(known_native_names(native_name).c_str(), 0, &code);
  return opened(locale, code, name);
}

LocalePtr open_chosen_locale(const std::string& name) {
  if (name.empty()) return open_user_locale();
  return is_native(name) ? open_native_locale(name) : open_locale(name);
}

std::string core_name(const std::string& name) {
  return is_native(name) ? map_native_name(name, kUsageError) : name;
}

std::string map_native_name(const std::string& native_name, ExitCode unknown) {
  const std::string known = known_native_names(native_name);
  if (known.empty())
    throw Failure(unknown, "unknown operating-system locale '" + native_name +
                               "'; 'lexicor list locales' shows those that are known");
  char name[kNameBytes];
  return LXMapNativeLocale(known.c_str(), name, sizeof name);
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
  for (int32_t i = 0; i + 1 < written; ++i) append_utf8(text, units[static_cast<size_t>(i)]);
  return text;
}

std::string language_territory(LXLocale* locale) {
  return text_item(locale, LX_ITEM_LANGUAGE).value_or("") + "_" +
         text_item(locale, LX_ITEM_TERRITORY).value_or("");
}

}  // namespace lexicor_cli
