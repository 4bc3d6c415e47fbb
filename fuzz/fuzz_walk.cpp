// Walking, counting, packing and classifying the characters of any bytes: forward and back, by bytes and by packed codes,
// by locale and by codepage, the plain form and the one with a shift state, all give the same characters.
#include <cstring>

#include "fuzz.h"

namespace lx::fuzz::walk {
namespace {

constexpr LXWChar kNone = 0xFFFFFFFF;

/// What a packed code says and its bytes do; a zero byte behind the first one is not stored.
void same_character(const Place& at, const char* text, int32_t bytes, LXWChar code) {
  char stored[8], named[8];
  const int32_t count = LXWToMb(stored, code);
  const bool whole = count == bytes;
  must(LXPutChar(at.locale, named, code) == 0 && memcmp(named, stored, static_cast<size_t>(count)) == 0,
       "a code is stored in one way");
  must(LXStrByteLength(code) == LXByteLengthW(at.locale, code), "a code has one length");
  if (!whole) return;
  must(memcmp(stored, text, static_cast<size_t>(bytes)) == 0, "a code is its bytes");
  for (const uint32_t type : {LX_CTYPE1, LX_CTYPE2, LX_CTYPE3})
    must(LXGetCharType(at.locale, text, type) == LXGetCharTypeW(at.locale, code, type), "a code has a type");
  if (bytes == 1) return;
  must(LXGetMbCtype(at.codepage, text) == LXGetMbCtypeW(at.codepage, code), "a code has a record");
  must(LXCpMbToUnicode(at.codepage, text) == LXCpMbToUnicodeW(at.codepage, code), "a code has a value");
  for (const uint32_t mask : {LX_C1_UPPER, LX_C1_LOWER}) {
    char other[8], state[8];
    const LXWChar other_code = LXCpMbCaseConvW(at.codepage, code, mask);
    LXPutChar(at.locale, named, other_code);
    const int32_t cased = LXCpMbCaseConv(at.codepage, text, other, mask);
    // Of bytes that are no character the other code may be longer than the width allows: they stay as they are.
    const char* const expected = LXStrByteLength(other_code) <= at.width ? named : text;
    must(cased > 0 && memcmp(expected, other, static_cast<size_t>(cased)) == 0, "a code has another case");
    if (bytes == at.width) LXCpMbCaseConvS(at.codepage, text, state, mask);
  }
  LXCpMbHalfToFullW(at.codepage, code), LXCpFullToHalfW(at.codepage, code);
}

void walk_plain(const Place& at, const Block<char>& text) {
  LXLocale* const l = at.locale;
  const char* p = text.data();
  int32_t chars = 0;
  for (; p < text.end() && LXByteLength(l, p) <= text.end() - p; ++chars) {
    const char* const next = LXNextChar(l, p);
    const auto bytes = static_cast<int32_t>(next - p);
    must(bytes == LXByteLength(l, p), "a step is a character");
    const LXWChar code = LXGetChar(l, p);
    must(code == LXMbToW(at.codepage, p), "a locale's codepage packs");
    must(LXPrevChar(l, text.data(), next) == p, "a step back undoes a step");
    const bool null = memchr(p, 0, static_cast<size_t>(bytes)) != nullptr;
    must((LXValidChar(l, p) == bytes) == !null, "a character is valid up to a null");
    same_character(at, p, bytes, code);
    LXUChar unit = 0;
    must(LXStringToUnicode(&unit, 1, l, p, bytes, 0) == 1, "a character has a value");
    must(bytes == 1 || unit == LXCpMbToUnicode(at.codepage, p), "it is the codepage's");
    p = next;
  }
  must(chars == LXNumChars(l, text.data(), text.size()), "counting is walking");
  must(p == LXMoveStringPointer(l, text.data(), text.size(), 0), "moving is walking");
  if (at.shift) return;
  must(p == LXMoveStringPointer(l, text.data(), chars, LX_CHARACTERS), "by characters too");
  must(p - text.data() == LXCpStrCharToByteLen(at.codepage, text.data(), 0, chars), "bytes of characters");
}

bool is_shift(char byte) {
  return byte == 0x0E || byte == 0x0F;
}

/// The block has one byte behind the text, which may be looked at.
void walk_states(const Place& at, const char* text, int32_t bytes, LXShiftState state) {
  LXLocale* const l = at.locale;
  const int32_t chars = LXNumCharsEx(l, text, state, bytes);
  must(chars == LXCpStrByteToCharLen(at.codepage, text, state, bytes), "the codepage counts alike");
  LXShiftState end_state = state;
  const char* const end = LXMoveStringPointerEx(l, text, state, bytes, &end_state, 0);
  must(end >= text && end <= text + bytes, "a walk ends in the text");
  const Block<LXWChar> codes(static_cast<size_t>(chars));
  must(LXMbToWideEx(l, codes.data(), codes.size(), text, state, bytes, 0) == chars, "a code is a character");
  // Of two shift bytes in a row both are passed: one by the step before, one by what looks at the character.
  for (int32_t i = 0; at.shift && i < bytes; ++i)
    if (is_shift(text[i]) && is_shift(text[i + 1])) return;
  const char* p = text;
  for (int32_t i = 0; i < chars; ++i) {
    must(LXGetCharEx(l, p, state) == codes.data()[i], "a step is a code");
    const int32_t length = LXByteLengthEx(l, p, state);
    must(LXGetCharTypeEx(l, p, state, LX_CTYPE1) != kNone && length >= 1, "a step has a type");
    LXShiftState next_state = state, back = state;
    const char* const next = LXNextCharEx(l, p, state, &next_state, 0);
    must(next - p >= length && next - p <= length + 2, "a step passes a character and shift bytes");
    const char* const previous = LXPrevCharEx(l, text, next, next_state, &back);
    must(previous >= text && previous < next, "a step back stays in the text");
    must(LXValidCharEx(l, p, state) <= at.width, "a character has the width");
    char stored[8];
    LXPutCharEx(l, stored, state, codes.data()[i]);
    LXMbToWS(at.codepage, p, LX_SHIFT_SINGLE);
    p = next, state = next_state;
  }
  must(p <= text + bytes + 1, "the walk ends with the text");
}

void values(const Place& at, LXUChar unit) {
  char bytes[8];
  const int32_t count = LXCpUnicodeToChar(at.codepage, unit, bytes);
  char packed[8];
  must(LXWToMb(packed, LXCpUnicodeToCharW(at.codepage, unit)) == count, "a value has one character");
  must(memcmp(packed, bytes, static_cast<size_t>(count)) == 0, "a value has one code");
  if (!at.shift) must(LXByteLength(at.locale, bytes) == count, "a value's character is whole");
  LXGetCharTypeU(at.locale, unit, LX_CTYPE2);
}

}  // namespace

FUZZ_TARGET(walk) {
  const Place& at = place(in);
  const LXShiftState state = in.flag() ? LXShiftState{LX_SHIFT_DOUBLE} : LXShiftState{LX_SHIFT_SINGLE};
  for (int i = 0; i < 4; ++i) values(at, static_cast<LXUChar>(in.number(2)));
  const Text<char> text = in.text(kPlain, at.locale, 200);
  walk_plain(at, Block<char>(text));
  const Block<char> followed(text + in.one_of("\0\x0E\x0F"
                                              "a"));
  walk_states(at, followed.data(), followed.size() - 1, at.shift ? state : LXShiftState{LX_SHIFT_SINGLE});
  LXShiftState begin = LX_SHIFT_DOUBLE;
  LXInitState(at.locale, &begin);
  must(begin == LX_SHIFT_SINGLE, "a text begins in the single-byte state");
  const Block<char> swapped(text);
  LXStrBigEndian(swapped.data(), swapped.size()), LXStrBigEndian(swapped.data(), swapped.size());
  must(Text<char>(swapped.data(), text.size()) == text, "swapping twice changes nothing");
}

}  // namespace lx::fuzz::walk
