// The extension of SQLite: collations, keys, case, conversion and formats of a locale, and the digest of its order.
//
// Texts of the database are UTF-8 or UTF-16, so that of a locale's name the codepage is not taken. Every handle belongs
// to one connection or to one statement, which the database lets one thread at a time use; each one counts as a use of
// the library, so that the order in which a connection frees them does not matter.
#include <dlfcn.h>
#include <sqlite3ext.h>

#include <algorithm>
#include <cctype>
#include <cstring>
#include <filesystem>
#include <map>
#include <memory>
#include <mutex>
#include <stdexcept>
#include <string>

#include "lexicor.hpp"

SQLITE_EXTENSION_INIT1

namespace {

namespace fs = std::filesystem;
using lexicor::Locale;

/// What a function says to the database in place of a result.
class Refusal : public std::runtime_error {
 public:
  using runtime_error::runtime_error;
};

/// The locale directory: of LX_LOCALEDIR, as the library finds it, or beside this file, installed or in its build
/// directory.
std::string locale_directory() {
  Dl_info info{};
  if (std::getenv("LX_LOCALEDIR") != nullptr ||
      dladdr(reinterpret_cast<const void*>(&locale_directory), &info) == 0)
    return {};
  const fs::path here = fs::weakly_canonical(info.dli_fname).parent_path();
  for (const char* const place : {LEXICOR_LOCALE_BESIDE, "../locale"}) {
    if (fs::exists(here / place / "control.nls")) return (here / place).lexically_normal();
  }
  return {};
}

std::mutex use_mutex;  // the first LXInit must not race with other calls

/// One use of the library.
class Use {
 public:
  Use() {
    const std::string directory = locale_directory();
    const std::lock_guard<std::mutex> lock(use_mutex);
    const int32_t code =
        LXInit(directory.empty() ? nullptr : directory.c_str(), nullptr, nullptr, nullptr, LX_NO_DEFAULTS);
    if (code == LX_OK) return;
    if (code == LX_W_DEFAULTS) LXTerm();
    throw Refusal("no locale directory; LX_LOCALEDIR can name one");
  }
  ~Use() {
    const std::lock_guard<std::mutex> lock(use_mutex);
    LXTerm();
  }
  Use(const Use&) = delete;
  Use& operator=(const Use&) = delete;
};

/// A locale with the use of the library that it needs.
struct Handle {
  Use use;
  Locale locale;

  /// `called` is what the user calls it.
  Handle(const std::string& name, const std::string& called) : locale(opened(name, called)) {}

 private:
  static Locale opened(const std::string& name, const std::string& called) {
    std::error_code error;
    Locale made(name, 0, error);
    if (error) throw Refusal(called + ": " + error.message());
    return made;
  }
};

/// A locale's name with the codepage of the database: "German_Austria.IBM273@Default" is German_Austria.UTF-8@Default.
std::string in_utf8(const std::string& name) {
  const size_t sort = name.find('@');
  return name.substr(0, std::min(name.find('.'), sort)) + ".UTF-8" +
         (sort == std::string::npos ? std::string() : name.substr(sort));
}

// Arguments.

std::string_view bytes_of(sqlite3_value* value) {
  const bool blob = sqlite3_value_type(value) == SQLITE_BLOB;
  const void* const data = blob ? sqlite3_value_blob(value) : sqlite3_value_text(value);
  const auto bytes = static_cast<size_t>(sqlite3_value_bytes(value));
  return data == nullptr ? std::string_view() : std::string_view(static_cast<const char*>(data), bytes);
}
std::string text_of(sqlite3_value* value, const char* what) {
  const std::string_view text = bytes_of(value);
  if (sqlite3_value_type(value) != SQLITE_TEXT || text.find('\0') != std::string_view::npos)
    throw Refusal(std::string(what) + " must be a text, without nulls");
  return std::string(text);
}

/// The locale of an argument. While a statement runs the database keeps one for each argument that stays the same; a
/// planner that calls a function keeps none.
std::shared_ptr<const Locale> locale_of(sqlite3_context* context, sqlite3_value** arguments, int at,
                                        bool codepage = false) {
  using Kept = std::shared_ptr<const Locale>;
  if (const auto* const kept = static_cast<const Kept*>(sqlite3_get_auxdata(context, at))) return *kept;
  const std::string name = text_of(arguments[at], codepage ? "a codepage" : "a locale");
  const auto handle = std::make_shared<Handle>(codepage ? "English." + name : in_utf8(name), name);
  const Kept locale(handle, &handle->locale);
  sqlite3_set_auxdata(context, at, new Kept(locale), [](void* kept) { delete static_cast<Kept*>(kept); });
  return locale;
}

// Results.

void give(sqlite3_context* context, std::string_view text) {
  sqlite3_result_text64(context, text.data(), text.size(), SQLITE_TRANSIENT, SQLITE_UTF8);
}
void give_blob(sqlite3_context* context, std::string_view bytes) {
  sqlite3_result_blob64(context, bytes.data(), bytes.size(), SQLITE_TRANSIENT);
}

using Function = void (*)(sqlite3_context*, int, sqlite3_value**);

/// A function of the database: a null among the arguments gives null, and what is thrown is what the database reports.
template <Function Body>
void guarded(sqlite3_context* context, int count, sqlite3_value** arguments) {
  try {
    for (int at = 0; at < count; ++at) {
      if (sqlite3_value_type(arguments[at]) == SQLITE_NULL) return;
    }
    Body(context, count, arguments);
  } catch (const std::bad_alloc&) {
    sqlite3_result_error_nomem(context);
  } catch (const std::system_error& error) {
    sqlite3_result_error(context, ("lexicor: " + error.code().message()).c_str(), -1);
  } catch (const std::exception& error) {
    sqlite3_result_error(context, (std::string("lexicor: ") + error.what()).c_str(), -1);
  }
}

/// What does not count, by the words for it.
uint32_t options_of(int count, sqlite3_value** arguments, int at) {
  if (count <= at) return 0;
  const std::string word = text_of(arguments[at], "what is ignored");
  if (word == "case") return LX_CASE_INSENSITIVE;
  if (word == "width") return LX_WIDTH_INSENSITIVE;
  throw Refusal("ignore 'case' or 'width', not '" + word + "'");
}

// Order.

struct Collation {
  Handle handle;
  uint32_t options;

  Collation(const std::string& locale, uint32_t ignored) : handle(in_utf8(locale), locale), options(ignored) {}
};

/// The key of a text. In binary order, where the library's key of an empty text is three nulls, that text comes first too.
std::string key_of(const Locale& locale, std::string_view text, uint32_t options) {
  const bool none = text.empty() && locale.number(LX_ITEM_SORT_ID) == 0;
  return none ? std::string() : locale.key(text, options);
}

/// Without regard to width the library's comparison of bytes is no order, since its result depends on which text is the
/// first: with options keys are compared, which it makes anyway.
int compare_keys_or_texts(const Collation& collation, std::string_view a, std::string_view b) {
  const Locale& locale = collation.handle.locale;
  if (collation.options == 0) return locale.compare(a, b);
  return key_of(locale, a, collation.options).compare(key_of(locale, b, collation.options));
}

/// Characters beyond U+FFFF are one character to the library: where all else is equal their code points decide.
int compare_long_characters(std::string_view a, std::string_view b) {
  const auto next = [](std::string_view text, size_t at) {
    while (at < text.size() && static_cast<unsigned char>(text[at]) < 0xF0) ++at;
    return at;
  };
  for (size_t i = 0, j = 0;; i += 4, j += 4) {
    i = next(a, i), j = next(b, j);
    if (i >= a.size() || j >= b.size()) return static_cast<int>(i < a.size()) - static_cast<int>(j < b.size());
    if (const int order = a.substr(i, 4).compare(b.substr(j, 4))) return order;
  }
}

int compare(void* user, int a_bytes, const void* a, int b_bytes, const void* b) {
  const std::string_view a_text(static_cast<const char*>(a), static_cast<size_t>(a_bytes));
  const std::string_view b_text(static_cast<const char*>(b), static_cast<size_t>(b_bytes));
  try {
    const int order = compare_keys_or_texts(*static_cast<const Collation*>(user), a_text, b_text);
    return order != 0 ? order : compare_long_characters(a_text, b_text);
  } catch (const std::exception&) {  // there is no memory, and no way to say so
    return a_text.compare(b_text);
  }
}

/// What lexicor_collation made of a name in a connection. The database refuses to change a collation while a statement
/// runs, and the one that calls is one: what is there already is left as it is. To the database `german` is `GERMAN`.
struct NameLess {
  bool operator()(const std::string& a, const std::string& b) const {
    return sqlite3_stricmp(a.c_str(), b.c_str()) < 0;
  }
};
using Made = std::map<std::string, std::pair<std::string, uint32_t>, NameLess>;

/// lexicor_collation(name, locale [, ignore]): makes an order of the connection, and gives the locale's whole name.
void collation(sqlite3_context* context, int count, sqlite3_value** arguments) {
  if (count < 2 || count > 3) throw Refusal("lexicor_collation(name, locale [, ignore])");
  auto& made_before = *static_cast<Made*>(sqlite3_user_data(context));
  const std::string name = text_of(arguments[0], "a collation's name");
  auto made = std::make_unique<Collation>(text_of(arguments[1], "a locale"), options_of(count, arguments, 2));
  const std::string locale = made->handle.locale.name();
  const auto known = made_before.find(name);
  if (known != made_before.end() && known->second == std::pair(locale, made->options))
    return give(context, locale);
  const std::pair kept(locale, made->options);
  sqlite3* const database = sqlite3_context_db_handle(context);
  // The database frees what it was given only when it took it.
  Collation* const given = made.release();
  const int code = sqlite3_create_collation_v2(database, name.c_str(), SQLITE_UTF8, given, compare,
                                               [](void* user) { delete static_cast<Collation*>(user); });
  if (code == SQLITE_OK) {
    made_before[name] = kept;
    return give(context, locale);
  }
  delete given;
  sqlite3_result_error(context, sqlite3_errmsg(database), -1);
  sqlite3_result_error_code(context, code);
}

/// lexicor_key(text, locale [, ignore])
void key(sqlite3_context* context, int count, sqlite3_value** arguments) {
  const auto locale = locale_of(context, arguments, 1);
  give_blob(context, key_of(*locale, bytes_of(arguments[0]), options_of(count, arguments, 2)));
}

/// lexicor_digest(locale): of what orders, the sort and the codepage.
void digest(sqlite3_context* context, int, sqlite3_value** arguments) {
  const auto locale = locale_of(context, arguments, 0);
  std::string text;
  for (const int32_t type : {LX_SORT, LX_CODEPAGE}) {
    for (const uint8_t byte : locale->digest(type)) {
      text += "0123456789abcdef"[byte >> 4];
      text += "0123456789abcdef"[byte & 0xF];
    }
  }
  give(context, text);
}

// Case and codepages.

/// lexicor_upper(text, locale), lexicor_lower(text, locale)
template <uint32_t Mode>
void map(sqlite3_context* context, int, sqlite3_value** arguments) {
  const std::string_view text = bytes_of(arguments[0]);
  // What UTF-8 has beyond the library's 16 bits has no case, and stays.
  const auto locale = locale_of(context, arguments, 1);
  std::string result;
  for (size_t at = 0; at < text.size();) {
    const bool is_long = static_cast<unsigned char>(text[at]) >= 0xF0;
    size_t end = is_long ? std::min(at + 4, text.size()) : at;
    while (!is_long && end < text.size() && static_cast<unsigned char>(text[end]) < 0xF0) ++end;
    const std::string_view run = text.substr(at, end - at);
    result += is_long ? std::string(run) : locale->map(run, Mode);
    at = end;
  }
  give(context, result);
}

/// Whether bytes, whose Unicode values are `units`, are characters of a codepage from end to end. UTF-8 has one form for
/// each character and none for surrogates, where the library reads others too.
bool all_characters(const Locale& source, std::string_view bytes, const std::u16string& units) {
  if (source.number(LX_ITEM_CODEPAGE_ID) == LX_CODEPAGE_UTF8)
    return source.from_unicode(units) == bytes &&
           std::none_of(units.begin(), units.end(), [](char16_t unit) { return (unit & 0xF800) == 0xD800; });
  LXShiftState state = LX_SHIFT_SINGLE;
  const char* const end = LXMoveStringPointerEx(source.get(), bytes.data(), LX_SHIFT_SINGLE,
                                                static_cast<int32_t>(bytes.size()), &state, 0);
  return end == bytes.data() + bytes.size() && units.find(u'\uFFFD') == std::u16string::npos;
}

/// lexicor_convert(bytes, from, to [, 'strict']): a text where `to` is UTF-8, else a blob.
void convert(sqlite3_context* context, int count, sqlite3_value** arguments) {
  const bool strict = count > 3 && text_of(arguments[3], "what is lost") == "strict";
  if (count > 3 && !strict) throw Refusal("the fourth argument can be 'strict' only");
  const std::string_view bytes = bytes_of(arguments[0]);
  const auto source = locale_of(context, arguments, 1, true), target = locale_of(context, arguments, 2, true);
  const std::string result = lexicor::convert(*target, *source, bytes);
  if (strict) {
    const std::u16string before = source->to_unicode(bytes);
    if (!all_characters(*source, bytes, before))
      throw Refusal("not all of it is text in " + text_of(arguments[1], "a codepage"));
    if (before != target->to_unicode(result))
      throw Refusal("not all of the text is in " + text_of(arguments[2], "a codepage"));
  }
  target->number(LX_ITEM_CODEPAGE_ID) == LX_CODEPAGE_UTF8 ? give(context, result) : give_blob(context, result);
}

// Formats. Unicode, since separators like U+202F are left out of a text of bytes.

template <class Write>
void give_units(sqlite3_context* context, const Locale& locale, Write write) {
  constexpr size_t kMost = 1 << 20;
  std::u16string text(128, u'\0');
  for (;;) {
    const int32_t units = write(reinterpret_cast<LXUChar*>(text.data()), static_cast<int32_t>(text.size()));
    const int32_t code = LXGetError(locale.get());
    if (code == LX_OK) return sqlite3_result_text16(context, text.data(), 2 * units, SQLITE_TRANSIENT);
    if (code != LX_E_SIZE || text.size() > kMost) throw std::system_error(lexicor::code(code));
    text.assign(8 * text.size(), u'\0');
  }
}

/// Whether a text is YYYY-MM-DD, and behind a blank or T HH:MM or HH:MM:SS, and then a fraction.
bool has_shape_of_moment(const std::string& text) {
  constexpr std::string_view kShape = "0000-00-00 00:00:00";
  std::string shape = text;
  for (char& c : shape) c = std::isdigit(static_cast<unsigned char>(c)) != 0 ? '0' : c;
  if (shape.size() > 10 && shape[10] == 'T') shape[10] = ' ';
  if (shape.size() > kShape.size() + 1 && shape[kShape.size()] == '.' &&
      shape.find_first_not_of('0', kShape.size() + 1) == std::string::npos)
    shape.resize(kShape.size());
  return (shape.size() == 10 || shape.size() == 16 || shape.size() == 19) &&
         kShape.substr(0, shape.size()) == shape;
}

/// A moment as the database writes it.
LXTime moment_of(const std::string& text) {
  std::tm given{};
  if (has_shape_of_moment(text)) {
    std::sscanf(text.c_str(), "%4d-%2d-%2d%*c%2d:%2d:%2d", &given.tm_year, &given.tm_mon, &given.tm_mday,
                &given.tm_hour, &given.tm_min, &given.tm_sec);
    given.tm_year -= 1900, given.tm_mon -= 1;
  }
  // What is out of range the calendar moves: the 31st of February is the 3rd of March.
  std::tm there = given;
  there.tm_wday = -1;
  timegm(&there);
  if (there.tm_wday < 0 || given.tm_mon != there.tm_mon || given.tm_mday != there.tm_mday ||
      given.tm_hour != there.tm_hour || given.tm_min != there.tm_min || given.tm_sec != there.tm_sec)
    throw Refusal("'" + text + "' is no date; YYYY-MM-DD HH:MM:SS is one");
  return {there.tm_sec, there.tm_min,  there.tm_hour, there.tm_mday,
          there.tm_mon, there.tm_year, there.tm_wday, there.tm_yday};
}

/// lexicor_format(number, locale [, 'currency' or 'international']), lexicor_format(moment, locale [, directives])
void format(sqlite3_context* context, int count, sqlite3_value** arguments) {
  const auto kept = locale_of(context, arguments, 1);
  const Locale& locale = *kept;
  const int type = sqlite3_value_type(arguments[0]);
  const std::string how = count > 2 ? text_of(arguments[2], "a format") : std::string();
  if (type == SQLITE_TEXT || type == SQLITE_BLOB) {
    const LXTime time = moment_of(std::string(bytes_of(arguments[0])));
    const std::u16string directives = count > 2 ? locale.to_unicode(how) : u"%x";
    return give_units(context, locale, [&](LXUChar* buffer, int32_t size) {
      return LXTimeToStringU(locale.get(), &time, buffer, size,
                             reinterpret_cast<const LXUChar*>(directives.data()),
                             static_cast<int32_t>(directives.size()), 0);
    });
  }
  if (count > 2 && how != "currency" && how != "international")
    throw Refusal("a number's format is 'currency' or 'international', not '" + how + "'");
  constexpr sqlite3_int64 kMostExact = sqlite3_int64{1} << 53;  // of a double
  const sqlite3_int64 whole = sqlite3_value_int64(arguments[0]);
  if (type == SQLITE_INTEGER && (whole > kMostExact || whole < -kMostExact))
    throw Refusal(std::to_string(whole) + " is beyond 2^53, up to which integers are written exactly");
  const bool integer = type == SQLITE_INTEGER && count < 3 && whole == static_cast<int32_t>(whole);
  const double value = sqlite3_value_double(arguments[0]);
  give_units(context, locale, [&](LXUChar* buffer, int32_t size) {
    if (integer) return LXLongToStringU(locale.get(), static_cast<int32_t>(whole), buffer, size, 0);
    if (count < 3) return LXDoubleToStringU(locale.get(), value, buffer, size, 0);
    return LXCurrencyToStringU(locale.get(), value, buffer, size, how == "currency" ? 0 : LX_INTERNATIONAL);
  });
}

struct Entry {
  const char* name;
  int least, most;  // arguments
  Function function;
};
constexpr int kPure = SQLITE_UTF8 | SQLITE_DETERMINISTIC | SQLITE_INNOCUOUS;
constexpr Entry kFunctions[] = {
    {"lexicor_key", 2, 3, guarded<key>},
    {"lexicor_digest", 1, 1, guarded<digest>},
    {"lexicor_upper", 2, 2, guarded<map<LX_MAP_UPPER>>},
    {"lexicor_lower", 2, 2, guarded<map<LX_MAP_LOWER>>},
    {"lexicor_convert", 3, 4, guarded<convert>},
    {"lexicor_format", 2, 3, guarded<format>},
};

}  // namespace

extern "C" __attribute__((visibility("default"))) int sqlite3_lexicor_init(sqlite3* database, char** message,
                                                                           const sqlite3_api_routines* api) {
  SQLITE_EXTENSION_INIT2(api);
  try {
    const Use use;  // whether there is a locale directory
  } catch (const std::exception& error) {
    *message = sqlite3_mprintf("lexicor: %s", error.what());
    return SQLITE_ERROR;
  }
  Made* const made = new (std::nothrow) Made;
  if (made == nullptr) return SQLITE_NOMEM;
  int code = sqlite3_create_function_v2(database, "lexicor_collation", -1, SQLITE_UTF8 | SQLITE_DIRECTONLY,
                                        made, guarded<collation>, nullptr, nullptr,
                                        [](void* user) { delete static_cast<Made*>(user); });
  for (const Entry& entry : kFunctions) {
    for (int count = entry.least; count <= entry.most && code == SQLITE_OK; ++count)
      code = sqlite3_create_function_v2(database, entry.name, count, kPure, nullptr, entry.function, nullptr,
                                        nullptr, nullptr);
  }
  return code;
}
