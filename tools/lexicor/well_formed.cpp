// A text is refused at its first malformed bytes.
#include "well_formed.h"

#include "character_values.h"
#include "command.h"
#include "hex.h"

namespace lexicor_cli {

void WellFormed::take(const char* data, size_t bytes) {
  const uint64_t start = offset_ + text_.size();
  if (input_.begins_file(start)) {
    // A character that the file before has begun has its place there.
    for (; offset_ < start && bytes > 0; --bytes) {
      text_ += *data++;
      look(false);
    }
    if (offset_ >= start) place_.restart();
  }
  text_.append(data, bytes);
  look(false);
}

void WellFormed::look(bool last) {
  size_t at = 0;
  while (at < text_.size()) {
    const char* const text = text_.data() + at;
    const char* const end = text_.data() + text_.size();
    const Stretch stretch = finder_.next(text, text_.size() - at, state_, last);
    place_.pass(text, stretch.good_bytes, state_);
    if (codepage_.shift_sensitive()) codepage_.whole_bytes(text, stretch.good_bytes, state_, &state_);
    offset_ += stretch.good_bytes;
    at += stretch.good_bytes;
    if (stretch.end != Stretch::End::kText) {
      const char* const bad = text + stretch.good_bytes;
      InputPlace place = input_.place(offset_);
      place.line = place_.line();
      place.column = place_.column();
      const std::string where = place.text() + ": ";
      if (stretch.end == Stretch::End::kLongUtf8)
        throw Failure(kDataError, where + code_point_name(long_utf8_code_point(bad, end)) +
                                      " is beyond U+FFFF, which only 'lexicor convert' takes");
      throw Failure(kDataError,
                    "malformed input at " + where + finder_.describe(bad, stretch.end_bytes, end, state_));
    }
    if (stretch.good_bytes == 0) break;
  }
  text_.erase(0, at);
}

}  // namespace lexicor_cli
