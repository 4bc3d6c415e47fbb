// A record is a text of its own: it begins and ends in the single-byte state, and its conversion shares nothing with its
// neighbours'.
#include "records.h"

#include <algorithm>

#include "character_values.h"

namespace lexicor_cli {

RecordSink::RecordSink(const Codepage& codepage, size_t bytes, bool cuts, Output& output)
    : codepage_(codepage),
      bytes_(bytes),
      cuts_(cuts),
      output_(output),
      blank_(static_cast<char>(LXCpUnicodeToCharW(codepage.object(), ' '))) {}

void RecordSink::end() {
  if (text_.size() > bytes_) drop_blanks();
  if (text_.size() > bytes_) {
    if (!cuts_)
      throw Failure(kDataError, "record " + std::to_string(number_) + " needs " + std::to_string(text_.size()) +
                                    " bytes and has " + std::to_string(bytes_) + "; --cut cuts it off");
    text_.resize(fitting());
    LXShiftState state;
    codepage_.whole_bytes(text_.data(), text_.size(), LX_SHIFT_SINGLE, &state);
    if (state == LX_SHIFT_DOUBLE) text_ += codepage_.shift_byte(LX_SHIFT_SINGLE);
    ++cut_;
  }
  text_.resize(bytes_, blank_);
  output_.write(text_);
  text_.clear();
  ++number_;
}

/// The bytes of a character; of UTF-8 also of one that the library does not know.
size_t RecordSink::char_bytes(size_t at, LXShiftState state) const {
  if (!codepage_.utf8()) return static_cast<size_t>(codepage_.char_bytes(&text_[at], state));
  size_t bytes = 1;
  while (at + bytes < text_.size() && is_utf8_trail(text_[at + bytes])) ++bytes;
  return bytes;
}

/// Blanks of the single-byte state at the end, as far as they do not fit.
void RecordSink::drop_blanks() {
  LXShiftState state = LX_SHIFT_SINGLE;
  size_t kept = 0;  // without the blanks at the end
  for (size_t at = 0; at < text_.size();) {
    if (codepage_.is_shift(text_[at])) {
      state = codepage_.state_after(text_[at++]);
      kept = at;
      continue;
    }
    const size_t bytes = char_bytes(at, state);
    const bool blank = state == LX_SHIFT_SINGLE && bytes == 1 && text_[at] == blank_;
    at += bytes;
    if (!blank) kept = at;
  }
  text_.resize(std::max(std::min(kept, text_.size()), std::min(bytes_, text_.size())));
}

/// The whole characters that fit, with room for the shift byte that closes them.
size_t RecordSink::fitting() const {
  LXShiftState state = LX_SHIFT_SINGLE;
  size_t fits = 0;
  for (size_t at = 0; at < text_.size();) {
    if (codepage_.is_shift(text_[at])) {
      state = codepage_.state_after(text_[at++]);
      if (state == LX_SHIFT_SINGLE && at <= bytes_) fits = at;
      continue;
    }
    at += char_bytes(at, state);
    if (at + (state == LX_SHIFT_DOUBLE ? 1 : 0) > bytes_) break;
    fits = at;
  }
  return fits;
}

void RecordReader::take(const char* data, size_t bytes) {
  while (bytes > 0) {
    const size_t part = std::min(bytes, bytes_ - taken_);
    recoder_.take(data, part);
    data += part;
    bytes -= part;
    taken_ += part;
    if (taken_ < bytes_) continue;
    recoder_.end_record();
    sink_.end();
    taken_ = 0;
    ++number_;
  }
}

void RecordReader::finish() const {
  if (taken_ != 0)
    throw Failure(kDataError, "the input ends inside record " + std::to_string(number_) + ": it has " +
                                  std::to_string(taken_) + " of " + std::to_string(bytes_) + " bytes");
}

}  // namespace lexicor_cli
