// How the time of a call grows with its text, on texts that ask most of it. A row gives the time at the largest
// size and the exponent of the growth between the last two sizes: 1 is a time in proportion to the text.
#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <map>

#include "codepages.h"
#include "families.h"
#include "texts.h"

namespace bench {
namespace {

constexpr size_t kSizes[] = {1u << 10, 1u << 14, 1u << 18, 1u << 22};  // bytes or units of a text
constexpr double kLongestNs = 2e9;  // a size that would take longer is left out

/// Makes the work on a text of a size.
using Make = std::function<Work(size_t size)>;
struct Case {
  const char* name;
  Make make;
};

std::string repeat(const std::string& unit, size_t bytes) {
  std::string text;
  text.reserve(bytes + unit.size());
  while (text.size() + unit.size() <= bytes) text += unit;
  return text;
}
std::u16string repeat(const std::u16string& unit, size_t units) {
  std::u16string text;
  while (text.size() + unit.size() <= units) text += unit;
  return text;
}

LXLocale* locale(const std::string& name) {
  static std::map<std::string, LocalePointer> known;
  LocalePointer& found = known[name];
  if (found == nullptr) found = open_locale(name);
  return found.get();
}

const LXUChar* units(const std::u16string& text) {
  return reinterpret_cast<const LXUChar*>(text.data());
}

constexpr char kUtf8[] = "German.UTF-8";
constexpr char kDoubleByte[] = "Japanese.MS932@Default";
constexpr char kShift[] = "Japanese.IBM939@Default";
constexpr char kSingle[] = "German.Latin1";

// Text in EBCDIC: the letter A is 0xC1, and double-byte 0x4881 stands between shift bytes.
const std::string kAccent = "e\xCC\x81", kUmlaut = "\xC3\xA4", kSharp = "\xC3\x9F", kKana = "\x83\x41",
                  kWide = "\xEF\xBC\xA1", kMark = "\xCC\x81", kEbcdicA = "\xC1", kShifted = "\x0E\x48\x81\x0F";

/// Looks for a part of a quarter of the text, which agrees everywhere but at its end.
Make find(const char* name, const std::string& letter, const std::string& last, uint32_t options) {
  return [=](size_t size) -> Work {
    const std::string text = repeat(letter, size), part = repeat(letter, size / 4) + last;
    return [=](char*) {
      return size_t{1} + (LXStrstr(locale(name), text.data(), length(text.size()), part.data(),
                                   length(part.size()), options) != nullptr);
    };
  };
}
Make find_shift(const std::string& letter, const std::string& last, uint32_t options) {
  return [=](size_t size) -> Work {
    const std::string text = repeat(letter, size), part = repeat(letter, size / 4) + last;
    return [=](char*) {
      LXShiftState state = LX_SHIFT_SINGLE;
      return size_t{1} +
             (LXStrstrEx(locale(kShift), text.data(), LX_SHIFT_SINGLE, length(text.size()), part.data(),
                         LX_SHIFT_SINGLE, length(part.size()), &state, options) != nullptr);
    };
  };
}
Make find_units(const char* name, char16_t letter, char16_t last, uint32_t options) {
  return [=](size_t size) -> Work {
    const std::u16string text(size, letter), part = std::u16string(size / 4, letter) + last;
    return [=](char*) {
      return size_t{1} + (LXStrstrU(locale(name), units(text), length(text.size()), units(part),
                                    length(part.size()), options) != nullptr);
    };
  };
}

/// Two texts that differ in case, or in width, at their beginning and otherwise at their end, compared in the
/// form for bytes.
using Compare = int32_t (*)(LXLocale*, const char*, int32_t, const char*, int32_t, uint32_t);
Make compared(Compare compare, const char* name, const std::string& unit, const std::string& end,
              const std::string& other_end, uint32_t options) {
  return [=](size_t size) -> Work {
    const std::string text = repeat(unit, size);
    return [compare, name, options, one = "A" + text + end,
            other = (options == LX_WIDTH_INSENSITIVE ? kWide : "a") + text + other_end](char*) {
      return size_t{1} + (compare(locale(name), one.data(), length(one.size()), other.data(),
                                  length(other.size()), options) < 0);
    };
  };
}
using CompareUnits = int32_t (*)(LXLocale*, const LXUChar*, int32_t, const LXUChar*, int32_t, uint32_t);
Make compared_units(CompareUnits compare, const char* name, const std::u16string& unit, uint32_t options) {
  return [=](size_t size) -> Work {
    const std::u16string text = repeat(unit, size);
    return [compare, name, options, one = u'A' + text + u'a', other = u'a' + text + u'b'](char*) {
      return size_t{1} + (compare(locale(name), units(one), length(one.size()), units(other),
                                  length(other.size()), options) < 0);
    };
  };
}

Make key(const char* name, const std::string& unit, uint32_t options) {
  return [=](size_t size) -> Work {
    return [name, options, text = repeat(unit, size),
            room = std::make_shared<std::vector<uint8_t>>(16 * size)](char*) {
      return count(LXStrxfrm(locale(name), room->data(), length(room->size()), text.data(), length(text.size()),
                             options));
    };
  };
}

Make mapped(const char* name, const std::string& unit, uint32_t mode) {
  return [=](size_t size) -> Work {
    return
        [name, mode, text = repeat(unit, size), room = std::make_shared<std::string>(4 * size, '\0')](char*) {
          return count(LXMapString(locale(name), room->data(), length(room->size()), text.data(),
                                   length(text.size()), mode));
        };
  };
}

Make converted(const char* to, const char* from, const std::string& unit, int32_t flags) {
  return [=](size_t size) -> Work {
    const std::string text = repeat(unit, size);
    const int32_t n = (flags & LX_CHARACTERS) != 0 ? LXNumChars(locale(from), text.data(), length(text.size()))
                                                   : length(text.size());
    return [to, from, flags, text, n, room = std::make_shared<std::string>(6 * size, '\0')](char*) {
      return count(
          LXConvertString(locale(to), room->data(), length(room->size()), locale(from), text.data(), n, flags));
    };
  };
}

/// As a stream that is given `bytes` bytes of room at a time.
Make converted_in_steps(const char* to, const char* from, const std::string& unit, int32_t bytes) {
  return [=](size_t size) -> Work {
    return [to, from, bytes, text = repeat(unit, size)](char*) {
      const std::shared_ptr<LXConversion> conversion(LXOpenConversion(locale(to), locale(from)),
                                                     LXCloseConversion);
      std::string room(static_cast<size_t>(bytes), '\0');
      const char* in = text.data();
      int32_t in_left = length(text.size()), rc = LX_E_OUTPUT_FULL;
      for (size_t calls = 0; rc == LX_E_OUTPUT_FULL && calls <= 8 * text.size(); ++calls) {
        char* out = room.data();
        int32_t out_left = bytes;
        rc = LXConvertBuffer(conversion.get(), &out, &out_left, &in, &in_left);
      }
      return size_t{1} + count(in_left);
    };
  };
}

/// All tokens of a text in which each second character divides.
Make tokens(const char* name, const std::string& unit, const std::string& set, uint32_t flags) {
  return [=](size_t size) -> Work {
    const std::string text = repeat(unit, size);
    const int32_t all = (flags & LX_CHARACTERS) != 0
                            ? LXNumChars(locale(name), text.data(), length(text.size()))
                            : length(text.size());
    return [name, set, flags, text, all](char*) {
      std::string left = text;
      char* next = left.data();
      int32_t n = all;
      size_t found = 1;
      while (next != nullptr &&
             LXStrtok(locale(name), next, &n, set.data(), length(set.size()), &next, flags) != nullptr)
        ++found;
      return found;
    };
  };
}

/// A text that is read from its beginning to its end by one call.
using Read = std::function<size_t(const std::string& text)>;
Make read(const std::string& unit, const Read& call) {
  return [=](size_t size) -> Work {
    return [text = repeat(unit, size), call](char*) { return size_t{1} + call(text); };
  };
}

/// Characters that are not in a set; with `set_share` the set has a character for so many bytes of the text.
Make spanned(const char* name, const std::string& unit, size_t set_share) {
  return [=](size_t size) -> Work {
    std::u16string set = u"\u00F6";
    for (size_t i = 1; set_share != 0 && i < std::min<size_t>(size / set_share, 20000); ++i)
      set += static_cast<char16_t>(0x3000 + i);
    return [name, text = repeat(unit, size), all = to_utf8(set)](char*) {
      return size_t{1} + count(LXStrcspn(locale(name), text.data(), length(text.size()), all.data(),
                                         length(all.size()), 0));
    };
  };
}

int32_t take_bytes(void* user, char* buffer, int32_t bytes) {
  auto* const text = static_cast<std::pair<const std::string*, size_t>*>(user);
  const size_t n = std::min(static_cast<size_t>(bytes), text->first->size() - text->second);
  if (n == 0) return -1;
  memcpy(buffer, text->first->data() + text->second, n);
  text->second += n;
  return length(n);
}

size_t read_line(const char* name, const std::string& text, uint32_t flags) {
  std::pair<const std::string*, size_t> user{&text, 0};
  LXStream* const stream = LXOpenStream(locale(name), take_bytes, &user, LX_STREAM_READ);
  std::string line(2 * text.size(), '\0');
  const int32_t n = LXReadString(stream, locale(name), line.data(), length(line.size()), flags);
  LXCloseStream(stream, locale(name));
  return count(n);
}

size_t truncated(const char* name, const std::string& text, uint32_t flags) {
  std::string copy = text;
  return count(LXTruncateString(locale(name), copy.data(), length(copy.size()), flags));
}

size_t read_double(const std::string& text, uint32_t flags) {
  const char* end = nullptr;
  LXStringToDouble(locale(kUtf8), text.data(), length(text.size()), &end, flags);
  return static_cast<size_t>(end - text.data());
}
size_t read_integer(const std::string& text, uint32_t flags) {
  const char* end = nullptr;
  LXStringToLong(locale(kUtf8), text.data(), length(text.size()), &end, 10, flags);
  return static_cast<size_t>(end - text.data());
}

Make times_written(const std::string& unit) {
  return [=](size_t size) -> Work {
    return [format = repeat(unit, size), room = std::make_shared<std::string>(8 * size, '\0')](char*) {
      const LXTime time{1, 2, 3, 4, 5, 106, 0, 154};
      return count(LXTimeToString(locale(kUtf8), &time, room->data(), length(room->size()), format.data(),
                                  length(format.size()), 0));
    };
  };
}
size_t read_time(const std::string& text) {
  LXTime time{};
  return count(LXStringToTime(locale(kUtf8), &time, text.data(), length(text.size()), text.data(),
                              length(text.size()), 0));
}

size_t walk_weights(const char* name, const std::string& text) {
  const char* at = text.data();
  int32_t left = length(text.size());
  uint16_t counter = 0;
  LXUChar look_ahead = LX_NO_LOOK_AHEAD;
  LXWeights first, second;
  uint8_t char_class = 0;
  size_t sets = 0;
  while (left > 0)
    sets += count(
        LXStrGetNextWeight(locale(name), &at, &left, &counter, &first, &second, &char_class, &look_ahead));
  return sets;
}

/// A call on text that changes its shift state at each character; `output` has eight bytes for each of its
/// bytes.
using ShiftedCall = int32_t (*)(const std::string& text, std::string* output);
Make shifted(ShiftedCall call) {
  return [=](size_t size) -> Work {
    return [call, text = repeat(kEbcdicA + kShifted, size),
            room = std::make_shared<std::string>(8 * size, '\0')](char*) {
      return size_t{1} + count(call(text, room.get()));
    };
  };
}
int32_t shifted_key(const std::string& text, std::string* output) {
  return LXStrxfrmEx(locale(kShift), reinterpret_cast<uint8_t*>(output->data()), length(output->size()),
                     text.data(), LX_SHIFT_SINGLE, length(text.size()), 0);
}
int32_t shifted_conversion(const std::string& text, std::string* output) {
  return LXConvertStringEx(locale(kUtf8), output->data(), LX_SHIFT_SINGLE, length(output->size()),
                           locale(kShift), text.data(), LX_SHIFT_SINGLE, length(text.size()), 0);
}
int32_t shifted_truncation(const std::string& text, std::string* output) {
  memcpy(output->data(), text.c_str(), text.size() + 1);
  return LXTruncateStringEx(locale(kShift), output->data(), LX_SHIFT_SINGLE, length(text.size()),
                            LX_DROP_FULL_BLANKS);
}
int32_t shifted_mapping(const std::string& text, std::string* output) {
  return LXMapStringEx(locale(kShift), output->data(), length(output->size()), text.data(), length(text.size()),
                       LX_MAP_LOWER);
}
int32_t shifted_count(const std::string& text, std::string*) {
  return LXNumCharsEx(locale(kShift), text.data(), LX_SHIFT_SINGLE, length(text.size()));
}
/// With a small letter in place of the first one.
int32_t shifted_comparison(const std::string& text, std::string* output) {
  memcpy(output->data(), text.data(), text.size());
  output->front() = '\x81';
  return LXStrcollEx(locale(kShift), text.data(), LX_SHIFT_SINGLE, length(text.size()), output->data(),
                     LX_SHIFT_SINGLE, length(text.size()), 0);
}
Make shifted_tokens() {
  return [=](size_t size) -> Work {
    return [text = repeat(kEbcdicA + kShifted, size)](char*) {
      std::string left = text;
      char* next = left.data();
      int32_t n = length(left.size());
      LXShiftState state = LX_SHIFT_SINGLE, token_state = LX_SHIFT_SINGLE;
      size_t found = 1;
      while (next != nullptr && LXStrtokEx(locale(kShift), next, &state, &n, kEbcdicA.data(), LX_SHIFT_SINGLE,
                                           1, &next, &token_state, 0) != nullptr)
        ++found;
      return found;
    };
  };
}

std::vector<Case> make_cases() {
  return {
      {"LXNumChars",
       read(kUmlaut,
            [](const std::string& t) { return count(LXNumChars(locale(kUtf8), t.data(), length(t.size()))); })},
      {"LXMoveStringPointer/characters", read(kKana,
                                              [](const std::string& t) {
                                                return static_cast<size_t>(
                                                    LXMoveStringPointer(locale(kDoubleByte), t.data(),
                                                                        length(t.size() / 2), LX_CHARACTERS) -
                                                    t.data());
                                              })},
      {"LXPrevChar/from the end", read(kKana,
                                       [](const std::string& t) {
                                         return static_cast<size_t>(
                                             LXPrevChar(locale(kDoubleByte), t.data(), t.data() + t.size()) -
                                             t.data());
                                       })},
      {"LXStrcpy", read(kUmlaut,
                        [](const std::string& t) {
                          std::string copy(t.size(), '\0');
                          return count(LXStrcpy(locale(kUtf8), copy.data(), length(copy.size()), t.data(),
                                                length(t.size()), 0));
                        })},
      {"LXStrcpy/characters", read(kUmlaut,
                                   [](const std::string& t) {
                                     std::string copy(t.size(), '\0');
                                     return count(LXStrcpy(locale(kUtf8), copy.data(), length(copy.size() / 2),
                                                           t.data(), length(t.size() / 2), LX_CHARACTERS));
                                   })},
      {"LXStrcat/to a long string", read(kUmlaut,
                                         [](const std::string& t) {
                                           std::string all = t + '\0' + "    ";
                                           return count(LXStrcat(locale(kUtf8), all.data(), length(all.size()),
                                                                 "ab", 2, 0));
                                         })},
      {"LXStrchr/absent", read(kUmlaut,
                               [](const std::string& t) {
                                 return static_cast<size_t>(
                                     LXStrchr(locale(kUtf8), t.data(), length(t.size()), 0xC3B6, 0) != nullptr);
                               })},
      {"LXStrcspn/one character", spanned(kUtf8, kUmlaut, 0)},
      {"LXStrcspn/set that grows", spanned(kUtf8, kUmlaut, 64)},
      {"LXStrstr/UTF-8", find(kUtf8, kUmlaut, "b", 0)},
      {"LXStrstr/UTF-8 caseless", find(kUtf8, kUmlaut, "b", LX_CASE_INSENSITIVE)},
      {"LXStrstr/UTF-8 caseless, special", find(kUtf8, kSharp, "b", LX_CASE_INSENSITIVE)},
      {"LXStrstr/UTF-8 binary caseless", find("German.UTF-8@BINARY", "a", "b", LX_CASE_INSENSITIVE)},
      {"LXStrstr/UTF-8 binary caseless, special",
       find("German.UTF-8@BINARY", kSharp, "b", LX_CASE_INSENSITIVE)},
      {"LXStrstr/UTF-8 any width", find(kUtf8, "a", "b", LX_WIDTH_INSENSITIVE)},
      {"LXStrstr/UTF-8 marks", find(kUtf8, kMark, "b", LX_CASE_INSENSITIVE)},
      {"LXStrstr/UTF-8 characters", find(kUtf8, "a", "b", LX_CHARACTERS)},
      {"LXStrstr/Latin1", find(kSingle, "a", "b", 0)},
      {"LXStrstr/Latin1 caseless", find(kSingle, "a", "b", LX_CASE_INSENSITIVE)},
      {"LXStrstr/Latin1 caseless, special", find(kSingle, "\xDF", "b", LX_CASE_INSENSITIVE)},
      {"LXStrstr/MS932 any width", find(kDoubleByte, kKana, "b", LX_WIDTH_INSENSITIVE)},
      {"LXStrstrEx", find_shift(kEbcdicA, "\xC2", 0)},
      {"LXStrstrEx/shifted", find_shift(kShifted, "\xC2", 0)},
      {"LXStrstrEx/caseless", find_shift(kEbcdicA, "\xC2", LX_CASE_INSENSITIVE)},
      {"LXStrstrU", find_units(kUtf8, u'a', u'b', 0)},
      {"LXStrstrU/caseless", find_units(kUtf8, u'a', u'b', LX_CASE_INSENSITIVE)},
      {"LXStrstrU/any width", find_units(kUtf8, u'a', u'b', LX_WIDTH_INSENSITIVE)},
      {"LXStrtok/UTF-8", tokens(kUtf8, kUmlaut + ",", ",", 0)},
      {"LXStrtok/UTF-8 characters", tokens(kUtf8, kUmlaut + ",", ",", LX_CHARACTERS)},
      {"LXStrtok/MS932 characters", tokens(kDoubleByte, kKana + ",", ",", LX_CHARACTERS)},
      {"LXStrtok/empty ones", tokens(kUtf8, ",", ",", 0)},
      {"LXTruncateString/blanks",
       read("  ", [](const std::string& t) { return truncated(kUtf8, t, LX_DROP_BLANKS); })},
      {"LXTruncateString/characters",
       read(kUmlaut, [](const std::string& t) { return truncated(kUtf8, t, LX_CHARACTERS | LX_DROP_BLANKS); })},
      {"LXTruncateString/wide blanks",
       read("\x81\x40", [](const std::string& t) { return truncated(kDoubleByte, t, LX_DROP_FULL_BLANKS); })},
      {"LXStrcmp/caseless", compared(LXStrcmp, kUtf8, kUmlaut + "A", "a", "b", LX_CASE_INSENSITIVE)},
      {"LXStrcmp/caseless, special", compared(LXStrcmp, kUtf8, kSharp, "a", "b", LX_CASE_INSENSITIVE)},
      {"LXStrcmp/any width", compared(LXStrcmp, kUtf8, kWide, "a", "b", LX_WIDTH_INSENSITIVE)},
      {"LXStrcmp/blanks at the end", compared(LXStrcmp, kUtf8, " ", "", " ", LX_IGNORE_BLANKS)},
      {"LXStrcmpU/caseless", compared_units(LXStrcmpU, kUtf8, u"\u00E4A", LX_CASE_INSENSITIVE)},
      {"LXStrcoll/equal to the end", compared(LXStrcoll, kUtf8, kUmlaut + "b", "a", "b", 0)},
      {"LXStrcoll/marks", compared(LXStrcoll, kUtf8, kMark, "a", "b", 0)},
      {"LXStrcoll/punctuation", compared(LXStrcoll, kUtf8, "-", "a", "b", 0)},
      {"LXStrcoll/expansions", compared(LXStrcoll, kUtf8, kSharp, "a", "b", 0)},
      {"LXStrcoll/pairs", compared(LXStrcoll, "Czech.UTF-8@Czech", "c", "h", "d", 0)},
      {"LXStrcoll/accents from the end",
       compared(LXStrcoll, "French.UTF-8@FrenchCanadian", kAccent, "e", "\xC3\xA9", 0)},
      {"LXStrcoll/caseless", compared(LXStrcoll, kUtf8, kUmlaut + "A", "a", "b", LX_CASE_INSENSITIVE)},
      {"LXStrcoll/any width", compared(LXStrcoll, kUtf8, kWide, "a", "b", LX_WIDTH_INSENSITIVE)},
      {"LXStrcoll/Thai", compared(LXStrcoll, "Thai.UTF-8@Thai", "\xE0\xB9\x80\xE0\xB8\x81", "a", "b", 0)},
      {"LXStrcollU/equal to the end", compared_units(LXStrcollU, kUtf8, u"\u00E4b", 0)},
      {"LXStrxfrm/letters", key(kUtf8, kUmlaut + "b", 0)},
      {"LXStrxfrm/punctuation", key(kUtf8, "-a", 0)},
      {"LXStrxfrm/accents from the end", key("French.UTF-8@FrenchCanadian", kAccent, 0)},
      {"LXStrxfrm/caseless", key(kUtf8, kUmlaut + "A", LX_CASE_INSENSITIVE)},
      {"LXStrxfrm/any width", key(kUtf8, kWide, LX_WIDTH_INSENSITIVE)},
      {"LXStrxfrm/Thai", key("Thai.UTF-8@Thai", "\xE0\xB9\x80\xE0\xB8\x81", 0)},
      {"LXStrGetNextWeight", read(kUmlaut + "b", [](const std::string& t) { return walk_weights(kUtf8, t); })},
      {"LXStrtokEx/shifted", shifted_tokens()},
      {"LXStrxfrmEx/shifted", shifted(shifted_key)},
      {"LXConvertStringEx/shifted", shifted(shifted_conversion)},
      {"LXMapStringEx/shifted", shifted(shifted_mapping)},
      {"LXStrcollEx/shifted", shifted(shifted_comparison)},
      {"LXNumCharsEx/shifted", shifted(shifted_count)},
      {"LXTruncateStringEx/shifted", shifted(shifted_truncation)},
      {"LXMapString/upper", mapped(kUtf8, kUmlaut, LX_MAP_UPPER)},
      {"LXMapString/upper, special", mapped(kUtf8, kSharp, LX_MAP_UPPER)},
      {"LXMapString/half width", mapped(kUtf8, kWide, LX_MAP_HALF_WIDTH)},
      {"LXMapString/digits", mapped(kUtf8, "\xD9\xA1", LX_MAP_DIGITS)},
      {"LXConvertString/UTF-8 to MS932", converted(kDoubleByte, kUtf8, "\xE3\x82\xA2 a", 0)},
      {"LXConvertString/characters", converted(kDoubleByte, kUtf8, "\xE3\x82\xA2 a", LX_CHARACTERS)},
      {"LXConvertString/malformed", converted(kDoubleByte, kUtf8, "\xFF\xC3", 0)},
      {"LXConvertBuffer/8 bytes of room", converted_in_steps(kDoubleByte, kUtf8, "\xE3\x82\xA2 a", 8)},
      {"LXStringToLong/digits", read("7", [](const std::string& t) { return read_integer(t, 0); })},
      {"LXStringToLong/zeros", read("0", [](const std::string& t) { return read_integer(t, 0); })},
      {"LXStringToLong/separators", read("1.", [](const std::string& t) { return read_integer(t, 0); })},
      {"LXStringToLong/white space", read(" ", [](const std::string& t) { return read_integer(t, 0); })},
      {"LXStringToLong/national digits",
       read("\xD9\xA1", [](const std::string& t) { return read_integer(t, LX_NATIONAL_DIGITS); })},
      {"LXStringToDouble/digits", read("7", [](const std::string& t) { return read_double(t, 0); })},
      {"LXStringToDouble/fraction", read("1", [](const std::string& t) { return read_double("0," + t, 0); })},
      {"LXStringToDouble/exponent", read("1", [](const std::string& t) { return read_double("1,E" + t, 0); })},
      {"LXStringToDouble/separators", read("1.", [](const std::string& t) { return read_double(t, 0); })},
      {"LXStringToDouble/national digits",
       read("\xD9\xA1", [](const std::string& t) { return read_double(t, LX_NATIONAL_DIGITS); })},
      {"LXTimeToString/long format", times_written("%A x")},
      {"LXStringToTime/long format", read("abc ", read_time)},
      {"LXGetEol/absent", read(kUmlaut,
                               [](const std::string& t) {
                                 uint32_t kind = 0;
                                 int32_t bytes = 0;
                                 return static_cast<size_t>(LXGetEol(locale(kUtf8), t.data(), length(t.size()),
                                                                     &kind, &bytes,
                                                                     LX_EOL_CRLF | LX_EOL_LF) != nullptr);
                               })},
      {"LXReadString/one line",
       read(kUmlaut, [](const std::string& t) { return read_line(kUtf8, t, LX_EOL_LF); })},
      {"LXReadString/returns",
       read("\r", [](const std::string& t) { return read_line(kUtf8, t, LX_EOL_LF | LX_DROP_RETURNS); })},
      {"LXReadString/characters",
       read(kUmlaut, [](const std::string& t) { return read_line(kUtf8, t, LX_EOL_LF | LX_CHARACTERS); })},
  };
}

/// The time of a pass at each size that is not too long.
void add_row(Table* table, const Case& one) {
  const std::string name = std::string("growth/") + one.name;
  if (!table->wants(name)) return;
  std::vector<std::pair<size_t, double>> times;
  double exponent = 1;
  for (const size_t size : kSizes) {
    if (!times.empty()) {
      const auto [before, ns] = times.back();
      if (ns * std::pow(static_cast<double>(size) / static_cast<double>(before), std::max(exponent, 1.0)) >
          kLongestNs)
        break;
    }
    times.emplace_back(size, table->least_ns(one.make(size)));
    if (times.size() > 1) {
      const auto &last = times[times.size() - 1], &before = times[times.size() - 2];
      exponent = std::log(last.second / before.second) /
                 std::log(static_cast<double>(last.first) / static_cast<double>(before.first));
    }
  }
  table->print_growth(name, times.back().second, times.back().first, exponent);
}

}  // namespace

void add_growth_rows(Table* table) {
  if (!table->wants_some("growth/")) return;
  for (const Case& one : make_cases()) add_row(table, one);
}

}  // namespace bench
