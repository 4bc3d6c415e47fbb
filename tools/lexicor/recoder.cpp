// Text goes to the library in large parts. A part of a codepage other than UTF-8 is whole and keeps everything
// when its Unicode values make the same bytes again and the target has all of them. Only what does not is
// parted into well-formed text and malformed bytes, and only well-formed text that loses something is walked
// character by character.
#include "recoder.h"

#include <algorithm>
#include <cstring>

#include "hex.h"
#include "pieces.h"

namespace lexicor_cli {

namespace {

// The longest character and a shift byte.
constexpr size_t kMostBytes = 5;
// Behind a loss the parts are small at first, so that many losses do not make the same text be tried many
// times.
constexpr size_t kFirstWindowBytes = 64;
constexpr char kSignature[] = "\xEF\xBB\xBF";
constexpr size_t kSignatureBytes = 3;
constexpr LXUChar kSignatureValue = 0xFEFF;

std::string bytes_text(const char* text, int32_t bytes) {
  return (bytes == 1 ? "byte " : "bytes ") + hex_bytes({text, static_cast<size_t>(bytes)});
}

std::string code_bytes(LXWChar code) {
  char bytes[4];
  return hex_bytes({bytes, static_cast<size_t>(LXWToMb(bytes, code))});
}

}  // namespace

Recoder::Recoder(const Codepage& source, const Codepage& target, const Input& input, Sink* output,
                 Losses& losses, const RecoderRules& rules)
    : source_(source),
      target_(target),
      input_(input),
      output_(output),
      losses_(losses),
      rules_(rules),
      malformed_(source, !target.utf8()),
      repertoire_(target),
      copies_(source.utf8() && target.utf8()),
      window_bytes_(Pieces::kBytes),
      place_(source),
      units_(1) {
  if (source.utf8()) return;
  replacement_ = LXCpUnicodeToCharW(source.object(), kReplacement);
  has_replacement_ = !Substitution(source).stands_for(kReplacement, replacement_);
  repertoire_.watch(kReplacement);
  if (!source_.single_byte()) return;
  const std::vector<LXUChar> values = single_byte_values(source);
  for (LXWChar byte = 0; byte < values.size(); ++byte) {
    if (LXCpUnicodeToCharW(source.object(), values[byte]) != byte) repertoire_.watch(values[byte]);
  }
}

void Recoder::take(const char* data, size_t bytes) {
  if (input_.begins_file(offset_ + text_.size())) begin_file(&data, &bytes);
  feed(data, bytes, false);
}

/// Goes on to the first character of a file, behind its signature. What the file before has begun has its place there, and
/// takes as many bytes as it needs, a byte at a time.
void Recoder::begin_file(const char** data, size_t* bytes) {
  const uint64_t start = offset_ + text_.size();
  while (offset_ < start) {
    const size_t done = convert_next(text_.data(), text_.size(), false);
    text_.erase(0, done);
    if (done != 0) continue;
    if (*bytes == 0) return;
    text_ += *(*data)++;
    --*bytes;
  }
  *data -= text_.size();
  *bytes += text_.size();
  text_.clear();
  place_.restart();
  if (offset_ != start || !begins_with_dropped_mark(*data, *bytes)) return;
  *data += kSignatureBytes;
  *bytes -= kSignatureBytes;
  offset_ += kSignatureBytes;
}

/// Counts places anew at a character that a file begins with: behind one that is cut at a file's end there may be several.
void Recoder::meet_file() {
  if (input_.begins_file(offset_)) place_.restart();
}

bool Recoder::begins_with_dropped_mark(const char* data, size_t bytes) const {
  return output_ != nullptr && source_.utf8() && rules_.unit_bytes == 0 &&
         (rules_.drops_marks || !repertoire_.has(kSignatureValue)) && bytes >= kSignatureBytes &&
         std::memcmp(data, kSignature, kSignatureBytes) == 0;
}

void Recoder::finish() {
  feed("", 0, true);
  if (target_state_ == LX_SHIFT_DOUBLE) {
    const char shift_in = target_.shift_byte(LX_SHIFT_SINGLE);
    write(&shift_in, 1);
  }
}

void Recoder::end_record() {
  finish();
  target_state_ = state_ = LX_SHIFT_SINGLE;
  place_.restart();
  ++record_;
}

void Recoder::take_malformed(uint32_t input_bytes, const std::string& what) {
  meet_file();
  if (losses_.places_wanted())
    losses_.record(LossKind::kMalformed, where(offset_), what);
  else
    losses_.count(LossKind::kMalformed, 1);
  place_.pass_malformed();
  offset_ += input_bytes;
  units_[0] = kReplacement;
  unit_count_ = 1;
  emit();
  flush();
}

void Recoder::feed(const char* data, size_t bytes, bool last) {
  if (text_.empty()) {
    const size_t done = convert(data, bytes, last);
    text_.assign(data + done, bytes - done);
  } else {
    text_.append(data, bytes);
    text_.erase(0, convert(text_.data(), text_.size(), last));
  }
  flush();
}

/// Converts a text but for a cut character at its end, which waits for more; returns the bytes that it took.
size_t Recoder::convert(const char* text, size_t bytes, bool last) {
  size_t at = 0;
  for (size_t done = 1; at < bytes && done != 0; at += done) done = convert_next(text + at, bytes - at, last);
  return at;
}

/// Converts the beginning of a text, or goes past a shift byte; 0 when it is a cut character, which waits for more.
size_t Recoder::convert_next(const char* text, size_t bytes, bool last) {
  meet_file();
  if (!source_.is_shift(*text)) return convert_some(text, bytes, last);
  state_ = source_.state_after(*text);
  ++offset_;
  return 1;
}

/// Converts the beginning of a text; 0 when it is a cut character, which waits for more.
size_t Recoder::convert_some(const char* text, size_t bytes, bool last) {
  if (!source_.utf8()) {
    const size_t done = convert_clean(text, source_.call_bytes(text, std::min(bytes, window_bytes_)));
    window_bytes_ = done == 0 ? kFirstWindowBytes : std::min(2 * window_bytes_, Pieces::kBytes);
    if (done != 0) return done;
  }
  const Stretch stretch = malformed_.next(text, bytes, state_, last);
  if (stretch.good_bytes != 0) convert_stretch(text, stretch.good_bytes);
  if (stretch.end != Stretch::End::kText) lose(text + stretch.good_bytes, stretch, text + bytes);
  return stretch.good_bytes + stretch.end_bytes;
}

/// Converts a text that loses nothing, but for a cut character or a shift byte at its end; 0 for any other.
size_t Recoder::convert_clean(const char* text, size_t bytes) {
  decode(text, bytes);
  if (unit_count_ == 0 || !repertoire_.has_all(units_.data(), unit_count_)) return 0;
  const size_t own = source_.single_byte() ? bytes : own_bytes(text, bytes);
  if (own == 0) return 0;
  if (losses_.places_wanted()) place_.pass(text, own, state_);
  offset_ += own;
  if (source_.shift_sensitive()) state_ = state_behind(source_);
  emit();
  return own;
}

/// The bytes that the decoded text has in the source again; 0 when they are others than at `text`.
size_t Recoder::own_bytes(const char* text, size_t bytes) {
  if (encoded_.size() < unit_count_ * kMostBytes) encoded_.resize(unit_count_ * kMostBytes);
  const auto own = static_cast<size_t>(LXUnicodeToStringEx(source_.locale(), encoded_.data(), state_,
                                                           static_cast<int32_t>(encoded_.size()), units_.data(),
                                                           static_cast<int32_t>(unit_count_), 0));
  return own <= bytes && std::memcmp(encoded_.data(), text, own) == 0 ? own : 0;
}

/// The state that a shift-sensitive codepage is in behind the decoded text.
LXShiftState Recoder::state_behind(const Codepage& codepage) const {
  const LXWChar last = LXCpUnicodeToCharW(codepage.object(), units_[unit_count_ - 1]);
  return last > 0xFF ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
}

/// Converts well-formed text.
void Recoder::convert_stretch(const char* text, size_t bytes) {
  if (copies_) {
    if (losses_.places_wanted()) place_.pass(text, bytes, state_);
    std::memcpy(room(bytes), text, bytes);
    out_used_ += bytes;
    pass(text, bytes);
    return;
  }
  decode(text, bytes);
  const bool walked = !source_.utf8() || !repertoire_.has_all(units_.data(), unit_count_);
  if (walked && !losses_.ignored()) {
    if (source_.utf8() && !losses_.places_wanted())
      count_losses();
    else
      find_losses(text, bytes);
  } else if (losses_.places_wanted()) {
    place_.pass(text, bytes, state_);
  }
  if (walked) hide_shift_bytes();
  pass(text, bytes);
  emit();
}

/// Converts what ends a stretch to the character that stands for what is lost.
void Recoder::lose(const char* text, const Stretch& stretch, const char* end) {
  const bool malformed = stretch.end == Stretch::End::kMalformed;
  const LossKind kind = malformed ? LossKind::kMalformed : LossKind::kLacking;
  if (losses_.places_wanted())
    losses_.record(kind, where(offset_),
                   malformed ? malformed_.describe(text, stretch.end_bytes, end, state_)
                             : lacks_text(long_utf8_code_point(text, end), target_.name()));
  else
    losses_.count(kind, 1);
  place_.pass_malformed();
  offset_ += input_bytes(text, stretch.end_bytes);
  units_[0] = kReplacement;
  unit_count_ = 1;
  emit();
}

InputPlace Recoder::where(uint64_t offset) const {
  if (!losses_.places_wanted()) return {};
  InputPlace place = input_.place(offset);
  place.line = rules_.records ? record_ : place_.line();
  place.column = place_.column();
  if (rules_.records) place.line_name = "record";
  return place;
}

/// The bytes that well-formed text had in the input.
uint64_t Recoder::input_bytes(const char* text, size_t bytes) const {
  if (rules_.unit_bytes == 0) return bytes;
  const char* const end = text + bytes;
  const auto chars = std::count_if(text, end, [](char c) { return !is_utf8_trail(c); });
  // Beyond U+FFFF two units of 16 bits.
  const auto pairs = rules_.unit_bytes == 2 ? std::count_if(text, end, is_long_utf8_lead) : 0;
  return static_cast<uint64_t>(chars + pairs) * rules_.unit_bytes;
}

void Recoder::decode(const char* text, size_t bytes) {
  if (units_.size() < bytes) units_.resize(bytes);
  const auto length = static_cast<int32_t>(bytes);
  const int32_t count = LXStringToUnicodeEx(units_.data(), length, source_.locale(), text, state_, length, 0);
  unit_count_ = static_cast<size_t>(std::max(count, 0));
}

/// Records the losses of the decoded text with their places.
void Recoder::find_losses(const char* text, size_t bytes) {
  const char* const begin = text;
  const char* const end = text + bytes;
  const char* passed = text;  // by the place
  LXShiftState state = state_, passed_state = state_;
  for (size_t i = 0; text < end; ++i) {
    if (source_.is_shift(*text)) state = source_.state_after(*text++);
    if (text == end) break;
    Char c{text, source_.char_bytes(text, state), 0, units_[i]};
    for (int32_t k = 0; k < c.bytes; ++k) c.code = c.code << 8 | static_cast<unsigned char>(text[k]);
    LossKind kind;
    std::string what;
    if (find_loss(c, &kind, &what)) {
      if (losses_.places_wanted()) {
        place_.pass(passed, static_cast<size_t>(text - passed), passed_state);
        passed = text;
        passed_state = state;
      }
      losses_.record(kind, where(offset_ + input_bytes(begin, static_cast<size_t>(text - begin))), what);
    }
    text += c.bytes;
  }
  if (losses_.places_wanted()) place_.pass(passed, static_cast<size_t>(end - passed), passed_state);
}

/// Counts the losses of decoded UTF-8, whose characters are what their values say.
void Recoder::count_losses() {
  for (size_t i = 0; i < unit_count_; ++i) {
    if (!repertoire_.has(units_[i])) losses_.count(repertoire_.kind_of_loss(units_[i]), 1);
  }
}

bool Recoder::find_loss(const Char& c, LossKind* kind, std::string* what) const {
  const bool worded = losses_.places_wanted();
  if (c.unicode == kReplacement && !source_.utf8() && !(has_replacement_ && c.code == replacement_)) {
    *kind = LossKind::kUnassigned;
    if (worded)
      *what =
          bytes_text(c.text, c.bytes) + (c.bytes == 1 ? " is" : " are") + " no character of " + source_.name();
    return true;
  }
  if (!repertoire_.has(c.unicode)) {
    *kind = repertoire_.kind_of_loss(c.unicode);
    if (worded) *what = repertoire_.describe_loss(c.unicode);
    return true;
  }
  const LXWChar own = LXCpUnicodeToCharW(source_.object(), c.unicode);
  if (own == c.code) return false;
  *kind = LossKind::kChanged;
  if (worded)
    *what = bytes_text(c.text, c.bytes) + (c.bytes == 1 ? " is " : " are ") + code_point_name(c.unicode) +
            ", which " + source_.name() + " writes as " + code_bytes(own);
  return true;
}

/// Goes past well-formed text.
void Recoder::pass(const char* text, size_t bytes) {
  offset_ += input_bytes(text, bytes);
  if (source_.shift_sensitive()) source_.whole_bytes(text, bytes, state_, &state_);
}

/// A character whose code in the target is a shift byte would change the state there.
void Recoder::hide_shift_bytes() {
  if (!target_.shift_sensitive()) return;
  for (size_t i = 0; i < unit_count_; ++i) {
    if (repertoire_.has(units_[i])) continue;
    const LXWChar code = LXCpUnicodeToCharW(target_.object(), units_[i]);
    if (code <= 0xFF && target_.is_shift(static_cast<char>(code))) units_[i] = kReplacement;
  }
}

/// Writes the decoded text in the target.
void Recoder::emit() {
  const size_t most = unit_count_ * kMostBytes;
  const int32_t written =
      LXUnicodeToStringEx(target_.locale(), room(most), target_state_, static_cast<int32_t>(most),
                          units_.data(), static_cast<int32_t>(unit_count_), 0);
  out_used_ += static_cast<size_t>(std::max(written, 0));
  if (target_.shift_sensitive() && unit_count_ != 0) target_state_ = state_behind(target_);
}

/// Room for so many bytes of output. It grows with the text.
char* Recoder::room(size_t bytes) {
  if (out_.size() < Pieces::kBytes && out_.size() - out_used_ < bytes)
    out_.resize(std::max(out_used_ + bytes, 2 * out_.size()));
  if (out_.size() - out_used_ < bytes) flush();
  if (out_.size() < bytes) out_.resize(bytes);
  return out_.data() + out_used_;
}

void Recoder::flush() {
  write(out_.data(), out_used_);
  out_used_ = 0;
}

void Recoder::write(const char* text, size_t bytes) {
  if (output_ != nullptr) output_->write(text, bytes);
}

}  // namespace lexicor_cli
