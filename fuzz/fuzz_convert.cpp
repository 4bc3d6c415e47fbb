// Any bytes from one codepage to another: at once, streamed in pieces, through Unicode, through packed codes and
// character by character gives the same; and texts of characters that the codepages have come back.
#include <cstring>

#include "fuzz.h"

namespace lx::fuzz::convert {
namespace {

constexpr size_t kMostCharBytes = 5;  // with a shift byte

/// Pieces end behind no shift byte: it would be forgotten. Outputs have the eight bytes that keep pending ones whole.
std::string streamed(Input& in, const Place& to, const Place& from, const std::string& text) {
  LXConversion* const conversion = LXOpenConversion(to.locale, from.locale);
  must(conversion != nullptr, "a conversion is opened");
  std::string all;
  int32_t code = LX_OK;
  for (size_t at = 0; at < text.size();) {
    size_t next = std::min(text.size(), at + 1 + in.below(9));
    while (next < text.size() && from.shift && (text[next - 1] == 0x0E || text[next - 1] == 0x0F)) ++next;
    const Block<char> piece(text.substr(at, next - at));
    const char* p = piece.data();
    int32_t left = piece.size();
    do {
      const Block<char> room(8 + in.below(9));
      char* to_place = room.data();
      int32_t to_left = room.size();
      code = LXConvertBuffer(conversion, &to_place, &to_left, &p, &left);
      must(to_left >= 0 && left >= 0 && to_place + to_left == room.end() && p + left == piece.end(),
           "places and counts move together");
      must(code == LX_OK || code == LX_E_OUTPUT_FULL || code == LX_E_INPUT_CUT, "a conversion goes on");
      all.append(room.data(), to_place);
    } while (code == LX_E_OUTPUT_FULL);
    must(left == 0, "a piece is taken");
    at = next;
  }
  must(LXCloseConversion(conversion) == LX_OK, "a conversion is closed");
  return all;
}

void ways_agree(Input& in, const Place& to, const Place& from, const std::string& text) {
  const Block<char> given(text);
  const size_t plenty = (text.size() + 1) * kMostCharBytes;
  const std::string whole = fitted<char>(
      [&](char* out, int32_t size) {
        return LXConvertStringEx(to.locale, out, 0, size, from.locale, given.data(), 0, given.size(), 0);
      },
      plenty);
  must(streamed(in, to, from, text) == whole, "streaming gives the same");
  // The ratio holds where the codepages differ, or nothing is replaced.
  if (to.codepage != from.codepage)
    must(whole.size() <= text.size() * static_cast<size_t>(LXConversionRatio(to.locale, from.locale)),
         "the ratio holds");
  const Units units = fitted<LXUChar>(
      [&](LXUChar* out, int32_t size) {
        return LXStringToUnicodeEx(out, size, from.locale, given.data(), 0, given.size(), 0);
      },
      text.size());
  const Block<LXUChar> values(units);
  const auto from_units = [&](char* out, int32_t size) {
    return LXUnicodeToStringEx(to.locale, out, 0, size, values.data(), values.size(), 0);
  };
  must(fitted<char>(from_units, plenty) == whole, "through Unicode it is the same");
  const Block<char> unbounded(units.size() * kMostCharBytes);
  const int32_t bytes = LXCpUnicodeToStr(to.codepage, values.data(), 0, values.size(), unbounded.data());
  must(std::string(unbounded.data(), static_cast<size_t>(bytes)) == whole, "the codepage gives the same");
  std::string one_by_one;
  LXShiftState state = LX_SHIFT_SINGLE;
  for (const LXUChar unit : units) {
    char stored[8];
    LXPutCharEx(to.locale, stored, state, LXCpUnicodeToCharW(to.codepage, unit));
    const LXWChar code = LXCpUnicodeToCharW(to.codepage, unit);
    const bool double_byte = to.shift && code > 0xFF, shifts = to.shift && double_byte != (state != 0);
    one_by_one.append(stored, static_cast<size_t>(LXStrByteLength(code)) + shifts);
    if (to.shift) state = double_byte ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
  }
  must(one_by_one == whole, "character by character it is the same");
  // Ends at a null.
  const std::string before(text.c_str());
  if (before.size() != text.size() || text.empty()) return;
  const Block<LXUChar> stored(text.size());
  const int32_t count = LXCpStrToUnicode(from.codepage, given.data(), given.size(), stored.data());
  must(Units(stored.data(), static_cast<size_t>(count)) == units, "the codepage reads the same");
}

/// The plain forms, which agree where there are no shift bytes, with every flag and length.
void call_plain(Input& in, const Place& to, const Place& from, const std::string& text) {
  const int32_t flags =
      in.one_of({0, int32_t{LX_TERMINATE}, int32_t{LX_CHARACTERS}, LX_TERMINATE | LX_CHARACTERS, 1});
  const bool chars = (flags & LX_CHARACTERS) != 0, terminated = in.flag();
  const Block<char> given(terminated || chars ? text + '\0' : text);
  const int32_t whole_chars = length_in_chars(from.codepage, text.data(), 0, count_of(text));
  const int32_t length = terminated ? -1 : chars ? whole_chars : count_of(text);
  const size_t size = in.below(64);
  const size_t room = chars ? std::max(to.units_of_chars<char>(size), from.units_of_chars<char>(size)) : size;
  const int32_t limit = static_cast<int32_t>(size);
  const Block<char> out(room);
  const Block<LXUChar> units(size);
  const Block<LXWChar> codes(size), target_codes(size);
  const auto fits = [&](int32_t result) { must(result >= -1 && result <= limit, "a result fits its size"); };
  fits(LXConvertString(to.locale, out.data(), limit, from.locale, given.data(), length, flags));
  const int32_t count = LXStringToUnicode(units.data(), limit, from.locale, given.data(), length, flags);
  fits(count);
  fits(LXUnicodeToString(to.locale, out.data(), limit, units.data(), std::max(count, 0), flags));
  fits(LXUnicodeToStringW(to.locale, target_codes.data(), limit, units.data(), std::max(count, 0), flags));
  const int32_t wide =
      LXMbToWide(from.locale, codes.data(), limit, given.data(), length, flags & LX_CHARACTERS);
  fits(wide);
  fits(LXConvertStringW(to.locale, target_codes.data(), limit, from.locale, codes.data(), wide, flags));
  fits(LXStringToUnicodeW(units.data(), limit, from.locale, codes.data(), wide, flags));
  fits(LXWideToMb(from.locale, out.data(), limit, codes.data(), wide, flags));
}

void comes_back(const Place& at, const Units& units) {
  in_all_forms([&](const auto& form) {
    using F = std::decay_t<decltype(form)>;
    if (at.shift && std::is_same_v<F, Plain>) return;
    // What was read, and not what was written: U+2F2C is written as A7CC in EUC-TW, which is read as U+5C6E, and that
    // has a code of its own.
    const Units read = decode(form, at.locale, encode(form, at.locale, units));
    must(decode(form, at.locale, encode(form, at.locale, read)) == read, "what was read comes back");
  });
  const Block<char> text(encode(kEx, at.locale, units));
  const Block<LXWChar> codes(units.size());
  const int32_t count = LXMbToWideEx(at.locale, codes.data(), codes.size(), text.data(), 0, text.size(), 0);
  const auto back = [&](char* out, int32_t size) {
    return LXWideToMbEx(at.locale, out, 0, size, codes.data(), count, 0);
  };
  must(fitted<char>(back, units.size() * kMostCharBytes) ==
           Text<char>(text.data(), static_cast<size_t>(text.size())),
       "codes become the bytes that they were");
  const Block<LXUChar> given(units);
  const Block<char> common(units.size() + 1);
  const Block<LXUChar> again(units.size() + 1);
  const int32_t ascii = LXComUnicodeToStr(given.data(), given.size(), common.data());
  if (ascii > 0) must(LXComStrToUnicode(common.data(), ascii, again.data()) == ascii, "ASCII comes back");
}

}  // namespace

FUZZ_TARGET(convert) {
  const Place &to = place(in), &from = place(in);
  comes_back(to, in.units(64));
  const std::string text = in.text(kEx, from.locale, 200);
  call_plain(in, to, from, text);
  ways_agree(in, to, from, text);
}

}  // namespace lx::fuzz::convert
