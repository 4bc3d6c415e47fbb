// Whether a line ends inside a character is told by the lengths that first bytes give: in codepages without shift
// states, by a table of them.
#include "text_lines.h"

#include <algorithm>
#include <cstring>
#include <limits>
#include <utility>

#include "place.h"

namespace lexicor_cli {

namespace {

constexpr size_t kFirstBlock = 64 * 1024;
constexpr size_t kMostGrowth = 256 * 1024 * 1024;  // at a time, of a long line
// Of a last line: a shift byte, a carriage return and a line feed.
constexpr size_t kMostEndBytes = 3;
constexpr size_t kMostLine = std::numeric_limits<int32_t>::max() - kMostEndBytes;

char byte_of(const Codepage& codepage, LXUChar unicode) {
  return static_cast<char>(LXCpUnicodeToCharW(codepage.object(), unicode));
}

}  // namespace

LineReader::LineReader(const Codepage& codepage, Input& input, bool null_ended, size_t block_bytes,
                       std::function<bool(std::string_view)> fits)
    : codepage_(codepage),
      input_(input),
      most_block_bytes_(block_bytes),
      block_bytes_(std::min(kFirstBlock, block_bytes)),
      fits_(std::move(fits)),
      end_(byte_of(codepage, null_ended ? 0 : '\n')),
      carriage_return_(byte_of(codepage, '\r')),
      null_ended_(null_ended) {}

bool LineReader::read(Arena* texts, Rows<Line>* lines) {
  // A line that is longer than a block makes the blocks grow, so that its text is not moved too often.
  const size_t room = std::max(block_bytes_, std::min(begun_.size(), kMostGrowth));
  block_bytes_ = std::min(4 * block_bytes_, most_block_bytes_);
  char* const block = texts->room(begun_.size() + kMostEndBytes + room);
  char* const text = block + begun_.size() + kMostEndBytes;
  const size_t got = input_.read(text, room);
  const char* at = text;
  const size_t lines_before = lines->size();
  const bool begins_file = input_.begins_file(offset_);
  if (!begun_.empty()) {
    if (got == 0 || begins_file) {
      add_last(block, lines);
    } else {
      std::memcpy(text - begun_.size(), begun_.data(), begun_.size());
      at = text - begun_.size();
    }
  }
  if (begins_file) file_lines_ = 0;
  const char* const end = text + got;
  while (const char* const line_end = find_end(at, end)) {
    // A line that has begun before has its place there.
    add_line(at, line_end, offset_ + static_cast<uint64_t>(at - text), lines);
    at = line_end;
  }
  const auto begun = static_cast<size_t>(end - at);
  // Ahead of its end, which may never come. The end's first byte may be there.
  if (begun > kMostLine + 1) refuse_length("more than " + std::to_string(kMostLine), offset_ + got - begun);
  begun_.assign(at, end);
  if (lines->size() != lines_before) texts->take(static_cast<size_t>(at - block));
  offset_ += got;
  return got != 0;
}

/// Past the end of the line at `at`, or null. A line end stands in the single-byte state of a shift-sensitive codepage;
/// no other one has characters with a line feed in them.
const char* LineReader::find_end(const char* at, const char* end) const {
  if (!codepage_.shift_sensitive()) {
    const auto* const found = static_cast<const char*>(std::memchr(at, end_, static_cast<size_t>(end - at)));
    return found == nullptr ? nullptr : found + 1;
  }
  for (LXShiftState state = LX_SHIFT_SINGLE; at < end;) {
    if (codepage_.is_shift(*at)) {
      state = codepage_.state_after(*at++);
    } else if (state == LX_SHIFT_SINGLE && *at == end_) {
      return at + 1;
    } else {
      at += std::min<ptrdiff_t>(codepage_.char_bytes(at, state), end - at);
    }
  }
  return nullptr;
}

void LineReader::add_line(const char* begin, const char* end, uint64_t offset, Rows<Line>* lines) {
  const auto bytes = static_cast<size_t>(end - begin);
  two_ = !null_ended_ && bytes > 1 && end[-2] == carriage_return_;
  const uint32_t end_bytes = two_ ? 2 : 1;
  check_length({begin, bytes - end_bytes}, offset);
  if (!codepage_.single_byte()) check_whole({begin, bytes - end_bytes}, offset, true);
  lines->push_back({begin, static_cast<uint32_t>(bytes), end_bytes});
  ++file_lines_;
}

/// Adds a last line without an end: it gets that of the line before it. Its text is made at `text`.
void LineReader::add_last(char* text, Rows<Line>* lines) {
  check_length(begun_, offset_ - begun_.size());
  const LXShiftState state = check_whole(begun_, offset_ - begun_.size(), false);
  std::memcpy(text, begun_.data(), begun_.size());
  char* end = text + begun_.size();
  if (state == LX_SHIFT_DOUBLE) *end++ = codepage_.shift_byte(LX_SHIFT_SINGLE);
  if (two_) *end++ = carriage_return_;
  *end++ = end_;
  lines->push_back({text, static_cast<uint32_t>(end - text),
                    static_cast<uint32_t>(end - text) - static_cast<uint32_t>(begun_.size())});
}

void LineReader::check_length(std::string_view text, uint64_t offset) const {
  if (text.size() > kMostLine || !fits_(text)) refuse_length(std::to_string(text.size()), offset);
}

void LineReader::refuse_length(const std::string& bytes, uint64_t offset) const {
  InputPlace where = input_.place(offset);
  where.line = file_lines_ + 1;
  where.column = 1;
  throw Failure(kDataError,
                "a line of " + bytes + " bytes is too long to be ordered: it begins at " + where.text());
}

LXShiftState LineReader::check_whole(std::string_view text, uint64_t offset, bool ended) const {
  LXShiftState state = LX_SHIFT_SINGLE;
  const size_t whole = whole_bytes(text, &state);
  if (whole == text.size()) return state;
  Place place(codepage_);
  place.pass(text.data(), whole, LX_SHIFT_SINGLE);
  InputPlace where = input_.place(offset + whole);
  where.line = file_lines_ + 1;
  where.column = place.column();
  throw Failure(kDataError, (ended ? "a line ends" : "the input ends") +
                                std::string(" inside the character that begins at ") + where.text());
}

size_t LineReader::whole_bytes(std::string_view text, LXShiftState* state) const {
  if (codepage_.shift_sensitive()) {
    // Idle shift bytes would be taken for characters. Without them the text is shorter by whole characters.
    if (codepage_.call_bytes(text.data(), text.size()) != text.size()) {
      const std::string joined = without_idle_shifts(codepage_, text);
      const size_t whole = codepage_.whole_bytes(joined.data(), joined.size(), LX_SHIFT_SINGLE, state);
      return text.size() - (joined.size() - whole);
    }
    return codepage_.whole_bytes(text.data(), text.size(), LX_SHIFT_SINGLE, state);
  }
  if (ends_whole(text)) return text.size();
  size_t at = 0;
  while (at < text.size()) {
    const auto bytes = static_cast<size_t>(codepage_.char_bytes(&text[at], LX_SHIFT_SINGLE));
    if (bytes > text.size() - at) break;
    at += bytes;
  }
  return at;
}

/// Whether none of the last bytes begins a character that goes beyond the end, wherever characters begin.
bool LineReader::ends_whole(std::string_view text) const {
  constexpr size_t kMostBytes = 4;  // of a character
  for (size_t back = 1; back < kMostBytes && back <= text.size(); ++back) {
    const char* const at = text.data() + text.size() - back;
    if (codepage_.char_bytes(at, LX_SHIFT_SINGLE) > static_cast<int32_t>(back)) return false;
  }
  return true;
}

size_t bytes_before_idle_shift(const Codepage& codepage, std::string_view text) {
  if (!codepage.shift_sensitive()) return text.size();
  LXShiftState state = LX_SHIFT_SINGLE;
  for (size_t at = 0; at < text.size();) {
    if (!codepage.is_shift(text[at])) {
      at += std::min<size_t>(static_cast<size_t>(codepage.char_bytes(&text[at], state)), text.size() - at);
      continue;
    }
    const LXShiftState next = codepage.state_after(text[at]);
    if (next == state || at + 1 == text.size() || codepage.is_shift(text[at + 1])) return at;
    state = next;
    ++at;
  }
  return text.size();
}

std::string without_idle_shifts(const Codepage& codepage, std::string_view text) {
  std::string result;
  LXShiftState state = LX_SHIFT_SINGLE, written = LX_SHIFT_SINGLE;
  for (size_t at = 0; at < text.size();) {
    if (codepage.is_shift(text[at])) {
      state = codepage.state_after(text[at++]);
      continue;
    }
    if (state != written) result += codepage.shift_byte(state);
    written = state;
    const auto bytes = static_cast<size_t>(codepage.char_bytes(&text[at], state));
    result += text.substr(at, bytes);
    at += bytes;
  }
  return result;
}

}  // namespace lexicor_cli
