// No character of several bytes has a line feed in it, so that lines are counted by bytes.
#include "place.h"

#include <algorithm>

#include "character_values.h"

namespace lexicor_cli {

namespace {

char byte_of(const Codepage& codepage, LXUChar unicode) {
  return static_cast<char>(LXCpUnicodeToCharW(codepage.object(), unicode));
}

/// How often a byte is there. Blocks of a constant size, counted in bytes, are a few vector instructions each.
uint64_t count_of(char wanted, const char* text, const char* end) {
  constexpr size_t kBlock = 128;
  uint64_t count = 0;
  for (; static_cast<size_t>(end - text) >= kBlock; text += kBlock) {
    uint8_t in_block = 0;
    for (size_t i = 0; i < kBlock; ++i) in_block = static_cast<uint8_t>(in_block + (text[i] == wanted ? 1 : 0));
    count += in_block;
  }
  return count + static_cast<uint64_t>(std::count(text, end, wanted));
}

bool is_ebcdic(const Codepage& codepage) {
  return byte_of(codepage, ' ') != ' ';
}

}  // namespace

Place::Place(const Codepage& codepage)
    : codepage_(codepage),
      feed_(byte_of(codepage, '\n')),
      new_line_(is_ebcdic(codepage) ? byte_of(codepage, 0x85) : feed_) {}

void Place::restart() {
  line_ = column_ = 1;
}

void Place::pass(const char* text, size_t bytes, LXShiftState state) {
  const char* const end = text + bytes;
  uint64_t ends = count_of(feed_, text, end);
  if (new_line_ != feed_) ends += count_of(new_line_, text, end);
  if (ends != 0) {
    line_ += ends;
    column_ = 1;
    const char* rest = end;
    while (!is_line_end(rest[-1])) --rest;
    text = rest;
    state = LX_SHIFT_SINGLE;
  }
  column_ += count_chars(text, static_cast<size_t>(end - text), state);
}

uint64_t Place::count_chars(const char* text, size_t bytes, LXShiftState state) const {
  if (bytes == 0) return 0;
  // A character beyond U+FFFF counts once, which the library does not know.
  if (codepage_.utf8())
    return static_cast<uint64_t>(std::count_if(text, text + bytes, [](char c) { return !is_utf8_trail(c); }));
  return static_cast<uint64_t>(LXNumCharsEx(codepage_.locale(), text, state, static_cast<int32_t>(bytes)));
}

}  // namespace lexicor_cli
