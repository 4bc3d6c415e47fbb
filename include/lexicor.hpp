/* Lexicor for C++17: owners of its handles, texts as views and strings, sizes that nobody counts, errors as
 * std::error_code. Everything is inline and calls the functions of lx.h, which say what each one does; get() gives the
 * handle for those that are not here.
 *
 * Errors. A function whose last parameter is a std::error_code stores it there, LX_OK for success; without one it
 * throws std::system_error. Codes are those of lx/base.h: `error == lexicor::code(LX_E_NO_CODEPAGE)`.
 * Texts. std::string_view is text in the locale's codepage, in a shift-sensitive one from the single-byte state on, in
 * which results end too; std::u16string_view is 16-bit Unicode. A text of 2 GB or more is LX_E_SIZE.
 * Threads. As in C: a handle is used by one thread at a time, and so is what refers to it. */
#ifndef LEXICOR_HPP
#define LEXICOR_HPP

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstring>
#include <ctime>
#include <exception>
#include <functional>
#include <limits>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <system_error>
#include <utility>
#include <vector>

#include "lx.h"

namespace lexicor {

// ---------------------------------------------------------------------------------------------- Errors

/// The codes of lx/base.h. Those that the standard has a condition for compare equal to it.
class Category : public std::error_category {
 public:
  const char* name() const noexcept override { return "lexicor"; }
  std::string message(int code) const override { return LXGetErrorText(code); }
  std::error_condition default_error_condition(int code) const noexcept override {
    switch (code) {
      case LX_E_INVALID:
        return std::errc::invalid_argument;
      case LX_E_MEMORY:
        return std::errc::not_enough_memory;
      case LX_E_SIZE:
        return std::errc::value_too_large;
      case LX_E_FILE_NOT_FOUND:
        return std::errc::no_such_file_or_directory;
      case LX_E_FILE_ACCESS:
        return std::errc::permission_denied;
      default:
        return {code, *this};
    }
  }
};
inline const Category& category() noexcept {
  static const Category instance;
  return instance;
}
inline std::error_code code(int32_t value) noexcept {
  return {value, category()};
}

/// Stands for an error_code that nobody gave: errors are thrown. Never written.
inline std::error_code& throws() noexcept {
  alignas(std::error_code) static unsigned char nobody[sizeof(std::error_code)];  // made without a guard
  return *reinterpret_cast<std::error_code*>(nobody);
}

namespace detail {

inline void report(int32_t value, std::error_code& error) {
  if (&error != &throws())
    error = code(value);
  else if (value != LX_OK)
    throw std::system_error(code(value));
}
template <class T>
T report(int32_t value, std::error_code& error, T result) {
  report(value, error);
  return result;
}

constexpr size_t kMostUnits = 0x7FFFFFF0;
/// The length of a text, or -1 where it does not fit.
inline int32_t length_of(size_t units) noexcept {
  return units <= kMostUnits ? static_cast<int32_t>(units) : -1;
}
/// A size that a result needs at most.
inline int32_t size_of(uint64_t units) noexcept {
  return static_cast<int32_t>(units < kMostUnits ? units : kMostUnits);
}
inline const LXUChar* units(std::u16string_view text) noexcept {
  return reinterpret_cast<const LXUChar*>(text.data());
}
inline LXUChar* units(std::u16string& text) noexcept {
  return reinterpret_cast<LXUChar*>(text.data());
}

/// What `write(buffer, size)` writes, which returns its length and says by last_error() whether it was too small.
template <class Write, class LastError>
std::string written(Write write, LastError last_error, std::error_code& error) {
  std::string result(128, '\0');
  for (;;) {
    const int32_t length = write(result.data(), static_cast<int32_t>(result.size()));
    const int32_t value = last_error();
    if (value == LX_E_SIZE && result.size() < (1u << 20)) {
      result.assign(2 * result.size(), '\0');
      continue;
    }
    result.resize(length > 0 ? static_cast<size_t>(length) : 0);
    return report(value, error, std::move(result));
  }
}

/// What `write(buffer, size)` writes with a null; it says nothing of a text that it cut, which fills all but the bytes
/// of one character.
template <class Write>
std::string written_whole(Write write) {
  constexpr size_t kCharacterBytes = 8;
  std::string result(256, '\0');
  for (;;) {
    write(result.data(), static_cast<int32_t>(result.size()));
    const size_t length = std::strlen(result.c_str());
    if (length + kCharacterBytes < result.size() || result.size() > (1u << 24)) {
      result.resize(length);
      return result;
    }
    result.assign(4 * result.size(), '\0');
  }
}

/// An operating system's name with its codeset in small letters and digits alone, as the library's table has them.
inline std::string with_plain_codeset(const std::string& name) {
  std::string plain;
  bool codeset = false;
  for (const char c : name) {
    codeset = c != '@' && (codeset || c == '.');
    if (codeset && c >= 'A' && c <= 'Z')
      plain += static_cast<char>(c + ('a' - 'A'));
    else if (!codeset || c == '.' || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9'))
      plain += c;
  }
  return plain;
}

template <class Handle, class Result, Result (*Release)(Handle*)>
struct Releaser {
  void operator()(Handle* handle) const noexcept { Release(handle); }
};

}  // namespace detail

// ---------------------------------------------------------------------------------------------- Library

/// One use of the library: everything else lives while there is one.
class Library {
 public:
  /// Null: the directory of LX_LOCALEDIR. Without a usable one the built-in objects are in force, which built_in()
  /// says; with LX_NO_DEFAULTS that is an error. While there is another use, the directory and the options are its.
  explicit Library(const char* directory = nullptr, uint32_t options = 0, std::error_code& error = throws()) {
    const int32_t value = LXInit(directory, nullptr, nullptr, nullptr, options);
    built_in_ = value == LX_W_DEFAULTS;
    const bool refused = built_in_ && options == LX_NO_DEFAULTS;
    alive_ = (value == LX_OK || built_in_) && !refused;
    if (refused) LXTerm();
    detail::report(alive_ ? LX_OK : value, error);
  }
  ~Library() {
    if (alive_) LXTerm();
  }
  Library(Library&& other) noexcept : alive_(std::exchange(other.alive_, false)), built_in_(other.built_in_) {}
  Library& operator=(Library&& other) noexcept {
    std::swap(alive_, other.alive_);
    std::swap(built_in_, other.built_in_);
    return *this;
  }
  explicit operator bool() const noexcept { return alive_; }
  bool built_in() const noexcept { return built_in_; }

  /// The names of all objects of LX_LANGUAGE, LX_TERRITORY, LX_CODEPAGE or LX_SORT.
  static std::vector<std::string> names(int32_t type) {
    std::pair<int32_t, std::vector<std::string>> found(type, {});
    LXEnumLocales(
        [](void* user, int32_t of, const char* name) -> int32_t {
          auto& into = *static_cast<decltype(found)*>(user);
          if (of == into.first) into.second.emplace_back(name);
          return 1;
        },
        &found);
    return std::move(found.second);
  }

 private:
  bool alive_ = false, built_in_ = false;
};

// ---------------------------------------------------------------------------------------------- Locale

/// What was read from the beginning of a text, and how many bytes that took; none: there was no value.
template <class T>
struct Parsed {
  T value;
  size_t bytes;
};

class Locale {
 public:
  /// By name, as LXGetLocale: "German_Austria.IBM273@GermanPhonebook", "German", "". `flags` are LX_USER_LOCALE and
  /// LX_FALLBACK.
  explicit Locale(const std::string& name, int32_t flags = 0, std::error_code& error = throws()) {
    int32_t value = LX_OK;
    handle_.reset(LXGetLocale(name.c_str(), flags, &value));
    learn();
    detail::report(handle_ != nullptr ? LX_OK : value, error);
  }
  /// Takes a handle over.
  explicit Locale(LXLocale* handle) noexcept : handle_(handle) { learn(); }
  /// The user's, as LX_LANG or the operating system has it.
  static Locale user(std::error_code& error = throws()) {
    return Locale("", LX_USER_LOCALE | LX_FALLBACK, error);
  }
  /// By the operating system's name, its codeset in any spelling: "de_DE.UTF-8", "de_DE.utf8".
  static Locale native(const std::string& name, std::error_code& error = throws()) {
    int32_t value = LX_OK;
    Locale made(LXConvertNativeLocale(name.c_str(), 0, &value));
    if (!made) made = Locale(LXConvertNativeLocale(detail::with_plain_codeset(name).c_str(), 0, &value));
    return detail::report(made ? LX_OK : value, error, std::move(made));
  }

  LXLocale* get() const noexcept { return handle_.get(); }
  explicit operator bool() const noexcept { return handle_ != nullptr; }
  /// In the locale's codepage, as all its texts.
  std::string name() const { return text(LX_ITEM_LOCALE_STRING); }

  // Items.

  std::string text(int32_t item, std::error_code& error = throws()) const {
    int32_t result = 0;
    std::string value = detail::written_whole([&](char* buffer, int32_t size) {
      result = LXGetLocaleTextInfoEx(get(), item, buffer, LX_SHIFT_SINGLE, size, 0);
      if (result < 0) *buffer = '\0';
    });
    return detail::report(result < 0 ? last_error() : LX_OK, error, std::move(value));
  }
  int32_t number(int32_t item, std::error_code& error = throws()) const {
    const int32_t value = LXGetLocaleNumInfo(get(), item, 0);
    return detail::report(last_error(), error, value);
  }
  void set(int32_t item, std::string_view value, std::error_code& error = throws()) {
    const int32_t length = detail::length_of(value.size());
    if (length < 0) return detail::report(LX_E_SIZE, error);
    // A length of 0 would change nothing.
    const int32_t done = length != 0
                             ? LXSetLocaleTextInfoEx(get(), item, value.data(), LX_SHIFT_SINGLE, length, 0)
                             : LXSetLocaleTextInfoEx(get(), item, "", LX_SHIFT_SINGLE, -1, 0);
    const int32_t code = done != 0 ? LX_OK : last_error();
    learn();
    detail::report(code, error);
  }
  void set(int32_t item, int32_t value, std::error_code& error = throws()) {
    const int32_t code = LXSetLocaleNumInfo(get(), item, value) != 0 ? LX_OK : last_error();
    learn();
    detail::report(code, error);
  }
  /// The SHA-256 of an object's data, to be stored beside keys that were made with it.
  std::array<uint8_t, LX_DIGEST_BYTES> digest(int32_t type, std::error_code& error = throws()) const {
    std::array<uint8_t, LX_DIGEST_BYTES> bytes{};
    LXGetLocaleDigest(get(), type, bytes.data(), LX_DIGEST_BYTES);
    return detail::report(last_error(), error, bytes);
  }

  // Order. `options` are 0, LX_CASE_INSENSITIVE, LX_WIDTH_INSENSITIVE, and LX_IGNORE_BLANKS where there are no keys.

  /// Below 0, 0 or above 0.
  int32_t compare(std::string_view a, std::string_view b, uint32_t options = 0,
                  std::error_code& error = throws()) const {
    const int32_t a_bytes = detail::length_of(a.size()), b_bytes = detail::length_of(b.size());
    if (a_bytes < 0 || b_bytes < 0) return detail::report(LX_E_SIZE, error, 0);
    const int32_t order = shift_ ? LXStrcollEx(get(), a.data(), LX_SHIFT_SINGLE, a_bytes, b.data(),
                                               LX_SHIFT_SINGLE, b_bytes, options)
                                 : LXStrcoll(get(), a.data(), a_bytes, b.data(), b_bytes, options);
    return detail::report(order != 0 ? LX_OK : last_error(), error, order);
  }
  int32_t compare(std::u16string_view a, std::u16string_view b, uint32_t options = 0,
                  std::error_code& error = throws()) const {
    const int32_t a_units = detail::length_of(a.size()), b_units = detail::length_of(b.size());
    if (a_units < 0 || b_units < 0) return detail::report(LX_E_SIZE, error, 0);
    const int32_t order = LXStrcollU(get(), detail::units(a), a_units, detail::units(b), b_units, options);
    return detail::report(order != 0 ? LX_OK : last_error(), error, order);
  }
  /// Bytes that order as compare() does. In binary order keys of 16-bit Unicode do not: see LXStrxfrm.
  std::string key(std::string_view text, uint32_t options = 0, std::error_code& error = throws()) const {
    std::string result;
    return key(text, &result, options, error), result;
  }
  std::string key(std::u16string_view text, uint32_t options = 0, std::error_code& error = throws()) const {
    std::string result;
    return key(text, &result, options, error), result;
  }
  /// The same into a string that keeps its memory.
  void key(std::string_view text, std::string* result, uint32_t options = 0,
           std::error_code& error = throws()) const {
    key_of(text.size(), result, error, [&](uint8_t* output, int32_t size, int32_t length) {
      return LXStrxfrmEx(get(), output, size, text.data(), LX_SHIFT_SINGLE, length, options);
    });
  }
  void key(std::u16string_view text, std::string* result, uint32_t options = 0,
           std::error_code& error = throws()) const {
    key_of(text.size(), result, error, [&](uint8_t* output, int32_t size, int32_t length) {
      return LXStrxfrmU(get(), output, size, detail::units(text), length, options);
    });
  }

  // Unicode, case and width.

  std::u16string to_unicode(std::string_view text, std::error_code& error = throws()) const {
    std::u16string result;
    const int32_t length = detail::length_of(text.size());
    if (length < 0) return detail::report(LX_E_SIZE, error, std::move(result));
    result.resize(text.size());
    const int32_t units =
        LXStringToUnicodeEx(detail::units(result), length, get(), text.data(), LX_SHIFT_SINGLE, length, 0);
    result.resize(units > 0 ? static_cast<size_t>(units) : 0);
    return detail::report(last_error(), error, std::move(result));
  }
  std::string from_unicode(std::u16string_view text, std::error_code& error = throws()) const {
    const uint64_t most = text.size() * character_bytes() + 2;
    if (most > detail::kMostUnits) return detail::report(LX_E_SIZE, error, std::string());
    std::string result(static_cast<size_t>(most), '\0');
    const int32_t bytes =
        LXUnicodeToStringEx(get(), result.data(), LX_SHIFT_SINGLE, static_cast<int32_t>(most),
                            detail::units(text), static_cast<int32_t>(text.size()), LX_TERMINATE);
    result.resize(bytes > 0 ? static_cast<size_t>(bytes - 1) : 0);
    return detail::report(last_error(), error, std::move(result));
  }
  std::string upper(std::string_view text, std::error_code& error = throws()) const {
    return map(text, LX_MAP_UPPER, error);
  }
  std::string lower(std::string_view text, std::error_code& error = throws()) const {
    return map(text, LX_MAP_LOWER, error);
  }
  /// `mode` is one of LX_MAP_....
  std::string map(std::string_view text, uint32_t mode, std::error_code& error = throws()) const {
    constexpr uint64_t kLikely = 2, kMost = 10;  // bytes for each one: two characters of four and a shift byte
    const int32_t length = detail::length_of(text.size());
    if (length < 0) return detail::report(LX_E_SIZE, error, std::string());
    std::string result;
    for (const uint64_t times : {kLikely, kMost}) {
      result.resize(static_cast<size_t>(detail::size_of(text.size() * times + kMost)));
      const auto size = static_cast<int32_t>(result.size());
      const int32_t bytes = LXMapStringEx(get(), result.data(), size, text.data(), length, mode);
      const bool whole = static_cast<uint64_t>(bytes < 0 ? 0 : bytes) + kMost <= result.size();
      if (!whole && times != kMost) continue;
      result.resize(bytes > 0 ? static_cast<size_t>(bytes) : 0);
      break;
    }
    return detail::report(last_error(), error, std::move(result));
  }

  // Numbers and times. `flags` are those of lx/number.h and lx/time.h, without LX_TERMINATE and LX_CHARACTERS.

  std::string format(int32_t value, uint32_t flags = 0, std::error_code& error = throws()) const {
    return written(error, [&](char* buffer, int32_t size) {
      return LXLongToStringEx(get(), value, buffer, LX_SHIFT_SINGLE, size, flags);
    });
  }
  std::string format(double value, uint32_t flags = 0, std::error_code& error = throws()) const {
    return written(error, [&](char* buffer, int32_t size) {
      return LXDoubleToStringEx(get(), value, buffer, LX_SHIFT_SINGLE, size, flags);
    });
  }
  std::string format_currency(double value, uint32_t flags = 0, std::error_code& error = throws()) const {
    return written(error, [&](char* buffer, int32_t size) {
      return LXCurrencyToStringEx(get(), value, buffer, LX_SHIFT_SINGLE, size, flags);
    });
  }
  std::string format(const LXTime& time, std::string_view format, uint32_t flags = 0,
                     std::error_code& error = throws()) const {
    const int32_t length = detail::length_of(format.size());
    if (length < 0) return detail::report(LX_E_SIZE, error, std::string());
    return written(error, [&](char* buffer, int32_t size) {
      return LXTimeToStringEx(get(), &time, buffer, LX_SHIFT_SINGLE, size, format.data(), LX_SHIFT_SINGLE,
                              length, flags);
    });
  }
  std::string format(const std::tm& time, std::string_view format_text, uint32_t flags = 0,
                     std::error_code& error = throws()) const {
    return format(LXTime{time.tm_sec, time.tm_min, time.tm_hour, time.tm_mday, time.tm_mon, time.tm_year,
                         time.tm_wday, time.tm_yday},
                  format_text, flags, error);
  }

  // Of a text of 2 GB or more the first 2 GB are read.

  Parsed<int32_t> parse_integer(std::string_view text, int32_t base = 10, uint32_t flags = 0,
                                std::error_code& error = throws()) const {
    const char* end = text.data();
    const int32_t value =
        LXStringToLongEx(get(), text.data(), LX_SHIFT_SINGLE, detail::size_of(text.size()), &end, base, flags);
    return detail::report(last_error(), error, Parsed<int32_t>{value, used(text, end)});
  }
  Parsed<double> parse_number(std::string_view text, uint32_t flags = 0,
                              std::error_code& error = throws()) const {
    const char* end = text.data();
    const double value =
        LXStringToDoubleEx(get(), text.data(), LX_SHIFT_SINGLE, detail::size_of(text.size()), &end, flags);
    return detail::report(last_error(), error, Parsed<double>{value, used(text, end)});
  }
  /// Fields that the format does not name stay as they are in `start`.
  Parsed<LXTime> parse_time(std::string_view text, std::string_view format, LXTime start = {},
                            uint32_t flags = 0, std::error_code& error = throws()) const {
    const int32_t bytes =
        LXStringToTimeEx(get(), &start, text.data(), LX_SHIFT_SINGLE, detail::size_of(text.size()),
                         format.data(), LX_SHIFT_SINGLE, detail::size_of(format.size()), flags);
    return detail::report(last_error(), error,
                          Parsed<LXTime>{start, bytes > 0 ? static_cast<size_t>(bytes) : 0});
  }

 private:
  int32_t last_error() const noexcept { return LXGetError(get()); }

  /// Comparison asks it often. Whoever gives get() another codepage makes the owner anew.
  void learn() noexcept {
    shift_ = handle_ != nullptr && LXGetLocaleNumInfo(get(), LX_ITEM_CODEPAGE_SHIFT, 0) == 1;
  }
  /// What one Unicode value can become, its shift byte counted.
  uint64_t character_bytes() const {
    return static_cast<uint64_t>(LXGetLocaleNumInfo(get(), LX_ITEM_CODEPAGE_WIDTH, 0)) +
           static_cast<uint64_t>(LXGetLocaleNumInfo(get(), LX_ITEM_CODEPAGE_SHIFT, 0));
  }
  static size_t used(std::string_view text, const char* end) noexcept {
    return static_cast<size_t>(end - text.data());
  }

  template <class Write>
  std::string written(std::error_code& error, Write write) const {
    return detail::written(
        write, [this] { return last_error(); }, error);
  }

  template <class Write>
  void key_of(size_t units, std::string* result, std::error_code& error, Write write) const {
    const int32_t length = detail::length_of(units);
    if (length < 0) return detail::report(LX_E_SIZE, error);
    uint8_t buffer[1024];  // keys of shorter texts are made in place
    int32_t bytes = write(buffer, sizeof buffer, length);
    if (bytes <= static_cast<int32_t>(sizeof buffer)) {
      result->assign(reinterpret_cast<const char*>(buffer), bytes < 0 ? 0 : static_cast<size_t>(bytes));
    } else {
      result->resize(static_cast<size_t>(bytes));
      bytes = write(reinterpret_cast<uint8_t*>(result->data()), bytes, length);
    }
    detail::report(bytes < 0 ? last_error() : LX_OK, error);
  }

  std::unique_ptr<LXLocale, detail::Releaser<LXLocale, int32_t, LXReleaseLocale>> handle_;
  bool shift_ = false;
};

/// Orders texts as a locale does: `std::sort(first, last, lexicor::Less(locale))`,
/// `std::map<std::string, T, lexicor::Less> map(lexicor::Less(locale))`. The locale must outlive it. With
/// LX_WIDTH_INSENSITIVE it makes the keys of both texts each time.
class Less {
 public:
  using is_transparent = void;
  explicit Less(const Locale& locale, uint32_t options = 0) noexcept : locale_(&locale), options_(options) {}
  bool operator()(std::string_view a, std::string_view b) const { return less(a, b); }
  bool operator()(std::u16string_view a, std::u16string_view b) const { return less(a, b); }

 private:
  /// Comparison without regard to width is no order where texts differ in length, of keys it is.
  template <class View>
  bool less(View a, View b) const {
    if ((options_ & LX_WIDTH_INSENSITIVE) != 0) return locale_->key(a, options_) < locale_->key(b, options_);
    return locale_->compare(a, b, options_) < 0;
  }

  const Locale* locale_;
  uint32_t options_;
};

/// The sort key of a text, which orders by its bytes: `std::map<std::string, T>` of keys, or texts that are compared
/// often. The locale must outlive it.
class Key {
 public:
  explicit Key(const Locale& locale, uint32_t options = 0) noexcept : locale_(&locale), options_(options) {}
  std::string operator()(std::string_view text) const { return locale_->key(text, options_); }
  std::string operator()(std::u16string_view text) const { return locale_->key(text, options_); }

 private:
  const Locale* locale_;
  uint32_t options_;
};

// ---------------------------------------------------------------------------------------------- Conversion

/// A whole text from one codepage to another. A character that the text's end cuts is left out.
inline std::string convert(const Locale& target, const Locale& source, std::string_view text,
                           std::error_code& error = throws()) {
  const uint64_t ratio = static_cast<uint64_t>(LXConversionRatio(target.get(), source.get()));
  const uint64_t most = text.size() * ratio + 2;
  if (most > detail::kMostUnits) return detail::report(LX_E_SIZE, error, std::string());
  std::string result(static_cast<size_t>(most), '\0');
  const int32_t bytes =
      LXConvertStringEx(target.get(), result.data(), LX_SHIFT_SINGLE, static_cast<int32_t>(most), source.get(),
                        text.data(), LX_SHIFT_SINGLE, static_cast<int32_t>(text.size()), LX_TERMINATE);
  result.resize(bytes > 0 ? static_cast<size_t>(bytes - 1) : 0);
  return detail::report(LXGetError(target.get()), error, std::move(result));
}

/// A text that comes in pieces, cut anywhere, and behind finish() another one. Both locales must outlive it. Without a
/// handle (a constructor that failed, or moved from) all is LX_E_INVALID.
class Conversion {
 public:
  Conversion(const Locale& target, const Locale& source, std::error_code& error = throws())
      : handle_(LXOpenConversion(target.get(), source.get())),
        source_(source.get()),
        target_(target.get()),
        ratio_(LXConversionRatio(target.get(), source.get())) {
    detail::report(handle_ != nullptr ? LX_OK : LXGetError(target_), error);
  }
  LXConversion* get() const noexcept { return handle_.get(); }
  explicit operator bool() const noexcept { return handle_ != nullptr; }

  /// Converts one more piece and puts the result behind `output`. The first bytes of a cut character are kept.
  void convert(std::string_view piece, std::string& output, std::error_code& error = throws()) {
    constexpr size_t kPiece = 1 << 20;
    if (!handle_) return detail::report(LX_E_INVALID, error);
    int32_t value = cut_ ? LX_E_INPUT_CUT : LX_OK;
    while (!piece.empty() && (value == LX_OK || value == LX_E_INPUT_CUT)) {
      const std::string_view some = piece.substr(0, kPiece);
      piece.remove_prefix(some.size());
      const size_t before = output.size();
      output.resize(before + some.size() * static_cast<size_t>(ratio_) + kPending);
      char* end = output.data() + before;
      const char* input = some.data();
      auto room = static_cast<int32_t>(output.size() - before), left = static_cast<int32_t>(some.size());
      value = LXConvertBuffer(get(), &end, &room, &input, &left);
      output.resize(static_cast<size_t>(end - output.data()));
      LXMoveStringPointerEx(target_, output.data() + before, state_,
                            static_cast<int32_t>(output.size() - before), &state_, 0);
    }
    cut_ = value == LX_E_INPUT_CUT;
    detail::report(cut_ ? LX_OK : value, error);
  }

  /// Ends the text: puts a Shift-In that is due behind `output`. LX_E_INPUT_CUT when a character was not completed.
  void finish(std::string& output, std::error_code& error = throws()) {
    if (!handle_) return detail::report(LX_E_INVALID, error);
    char shift[2];
    const int32_t bytes = LXTerminateStringEx(target_, shift, state_, 0);
    output.append(shift, bytes > 0 ? static_cast<size_t>(bytes) : 0);
    state_ = LX_SHIFT_SINGLE;
    const bool cut = std::exchange(cut_, false);
    handle_.reset(LXOpenConversion(target_, source_));  // the next text begins in its own states
    const int32_t value = handle_ != nullptr ? LX_OK : LXGetError(target_);
    detail::report(cut ? LX_E_INPUT_CUT : value, error);
  }

 private:
  static constexpr size_t kPending = 16;
  std::unique_ptr<LXConversion, detail::Releaser<LXConversion, int32_t, LXCloseConversion>> handle_;
  LXLocale *source_, *target_;
  int32_t ratio_;
  LXShiftState state_ = LX_SHIFT_SINGLE;
  bool cut_ = false;
};

// ---------------------------------------------------------------------------------------------- Streams

/// Characters that come from, or go to, a callable: it moves up to so many bytes, 0 at the end, and may throw, which
/// the function that called it throws on. The locale must outlive it. Closed, moved from or not opened, all but close()
/// is LX_E_INVALID.
class Stream {
 public:
  using Transfer = std::function<size_t(char* buffer, size_t bytes)>;

  /// `mode` is LX_STREAM_READ or LX_STREAM_WRITE.
  Stream(const Locale& locale, uint32_t mode, Transfer transfer, std::error_code& error = throws())
      : state_(new State{std::move(transfer), nullptr}), locale_(locale.get()) {
    handle_ = LXOpenStream(locale_, move_bytes, state_.get(), mode);
    detail::report(handle_ != nullptr ? LX_OK : LXGetError(locale_), error);
  }
  /// What is left is offered once more; close() says whether it was taken.
  ~Stream() {
    if (handle_ != nullptr) LXCloseStream(handle_, locale_);
  }
  Stream(Stream&& other) noexcept
      : state_(std::move(other.state_)),
        locale_(other.locale_),
        handle_(std::exchange(other.handle_, nullptr)) {}
  Stream& operator=(Stream&& other) noexcept {
    std::swap(state_, other.state_);
    std::swap(locale_, other.locale_);
    std::swap(handle_, other.handle_);
    return *this;
  }
  LXStream* get() const noexcept { return handle_; }
  explicit operator bool() const noexcept { return handle_ != nullptr; }

  /// The next line with its end, or what is left of the text; nothing at its end. A line of more than `most` bytes
  /// comes in pieces; `most` is 8 at least, so that a character fits. `ends` are LX_EOL_... and LX_DROP_RETURNS.
  std::optional<std::string> line(uint32_t ends = LX_EOL_LF, int32_t most = 4096,
                                  std::error_code& error = throws()) {
    if (handle_ == nullptr) return detail::report(LX_E_INVALID, error, std::nullopt);
    most = std::max(most, 8);
    std::string text(static_cast<size_t>(most), '\0');
    const int32_t bytes = LXReadStringEx(get(), locale_, text.data(), most, ends);
    text.resize(bytes > 0 ? static_cast<size_t>(bytes) : 0);
    check(error);
    if (bytes < 0) return std::nullopt;
    return text;
  }

  /// Writes a text; a character that its end cuts is left out.
  void write(std::string_view text, std::error_code& error = throws()) {
    if (handle_ == nullptr) return detail::report(LX_E_INVALID, error);
    std::vector<LXWChar> codes(text.size());
    const int32_t length = detail::length_of(text.size());
    const int32_t count =
        LXMbToWideEx(locale_, codes.data(), length, text.data(), LX_SHIFT_SINGLE, length < 0 ? 0 : length, 0);
    int32_t value = length < 0 ? LX_E_SIZE : LX_OK;
    for (int32_t i = 0; i < count && value == LX_OK; ++i)
      if (LXWriteCharW(get(), locale_, codes[static_cast<size_t>(i)], 0) == 0) value = LXGetError(locale_);
    check(error, value);
  }

  void flush(std::error_code& error = throws()) {
    if (handle_ == nullptr) return detail::report(LX_E_INVALID, error);
    check(error, LXFlushStream(get(), locale_) != 0 ? LX_OK : LXGetError(locale_));
  }
  /// Ends a text that is written, in the single-byte state.
  void close(std::error_code& error = throws()) {
    LXStream* const stream = std::exchange(handle_, nullptr);
    if (stream != nullptr) check(error, LXCloseStream(stream, locale_) != 0 ? LX_OK : LXGetError(locale_));
  }

 private:
  struct State {
    Transfer transfer;
    std::exception_ptr thrown;
  };
  static int32_t move_bytes(void* user, char* buffer, int32_t bytes) {
    auto& state = *static_cast<State*>(user);
    try {
      return static_cast<int32_t>(state.transfer(buffer, static_cast<size_t>(bytes)));
    } catch (...) {
      state.thrown = std::current_exception();
      return -1;
    }
  }

  void check(std::error_code& error) { check(error, LXGetError(locale_)); }
  void check(std::error_code& error, int32_t value) {
    if (const std::exception_ptr thrown = std::exchange(state_->thrown, nullptr))
      std::rethrow_exception(thrown);
    detail::report(value, error);
  }

  std::unique_ptr<State> state_;
  LXLocale* locale_;
  LXStream* handle_ = nullptr;
};

// ---------------------------------------------------------------------------------------------- Catalogs

/// Messages in the codepage of the locale, which must outlive the catalog.
class Catalog {
 public:
  /// As LXOpenCatalog finds it: `name` is a path or a template of one, tried behind those of `directory`.
  Catalog(const Locale& locale, const std::string& name, const char* directory = nullptr,
          uint32_t flags = LX_CATALOG_LOAD, std::error_code& error = throws())
      : handle_(LXOpenCatalog(locale.get(), directory, name.c_str(), flags)) {
    detail::report(handle_ != nullptr ? LX_OK : LXGetError(locale.get()), error);
  }
  LXCatalog* get() const noexcept { return handle_.get(); }

  /// A message; without one LX_E_MESSAGE, or `otherwise` where that is given.
  std::string message(uint32_t set, uint32_t number, const char* otherwise = nullptr,
                      std::error_code& error = throws()) const {
    int32_t value = LX_OK;
    std::string text = detail::written_whole([&](char* buffer, int32_t size) {
      *buffer = '\0';
      value = LXGetMessage(get(), set, number, buffer, size, otherwise);
    });
    return detail::report(value, error, std::move(text));
  }

 private:
  std::unique_ptr<LXCatalog, detail::Releaser<LXCatalog, int32_t, LXCloseCatalog>> handle_;
};

}  // namespace lexicor

#endif
