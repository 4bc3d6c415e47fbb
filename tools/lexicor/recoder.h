// Converts a text that comes in pieces from one codepage to another, and finds what is lost on the way.
#pragma once

#include <lx.h>

#include <string>
#include <vector>

#include "codepage.h"
#include "input.h"
#include "loss.h"
#include "malformed.h"
#include "output.h"
#include "place.h"
#include "repertoire.h"

namespace lexicor_cli {

/// What a text is, beside its codepages.
struct RecoderRules {
  bool drops_marks =
      false;  // the signature of UTF-8 that a file begins with; else where the target lacks U+FEFF
  /// The text was units of so many bytes, and comes as UTF-8; 0: it is as it was.
  uint32_t unit_bytes = 0;
  bool records = false;  // places are those of records, which end_record() counts
};

class Recoder {
 public:
  /// Without an output it finds the losses only, and a signature is text.
  Recoder(const Codepage& source, const Codepage& target, const Input& input, Sink* output, Losses& losses,
          const RecoderRules& rules = {});

  /// Converts the next bytes of the input, of one file. A file may begin with the signature of UTF-8.
  void take(const char* data, size_t bytes);
  /// Converts bytes of the input that make no character, which `what` says.
  void take_malformed(uint32_t input_bytes, const std::string& what);
  /// Begins a file of a text that was units: places are counted anew.
  void begin_units() { place_.restart(); }
  /// Goes past bytes of the input that are no text.
  void skip(uint32_t input_bytes) { offset_ += input_bytes; }
  /// Ends the text, in the single-byte state.
  void finish();
  /// Ends a record as a text.
  void end_record();

 private:
  /// A character of a text with its code and its Unicode value.
  struct Char {
    const char* text;
    int32_t bytes;
    LXWChar code;
    LXUChar unicode;
  };

  void begin_file(const char** data, size_t* bytes);
  void meet_file();
  bool begins_with_dropped_mark(const char* data, size_t bytes) const;
  void feed(const char* data, size_t bytes, bool last);
  size_t convert(const char* text, size_t bytes, bool last);
  size_t convert_next(const char* text, size_t bytes, bool last);
  size_t convert_some(const char* text, size_t bytes, bool last);
  size_t convert_clean(const char* text, size_t bytes);
  size_t own_bytes(const char* text, size_t bytes);
  LXShiftState state_behind(const Codepage& codepage) const;
  void convert_stretch(const char* text, size_t bytes);
  void lose(const char* text, const Stretch& stretch, const char* end);
  void decode(const char* text, size_t bytes);
  void find_losses(const char* text, size_t bytes);
  void count_losses();
  bool find_loss(const Char& c, LossKind* kind, std::string* what) const;
  void pass(const char* text, size_t bytes);
  void hide_shift_bytes();
  void emit();
  char* room(size_t bytes);
  void flush();
  void write(const char* text, size_t bytes);
  InputPlace where(uint64_t offset) const;
  uint64_t input_bytes(const char* text, size_t bytes) const;

  const Codepage& source_;
  const Codepage& target_;
  const Input& input_;
  Sink* const output_;
  Losses& losses_;
  const RecoderRules rules_;
  const MalformedFinder malformed_;
  Repertoire repertoire_;  // of the target
  const bool copies_;      // UTF-8 to UTF-8
  LXWChar replacement_ = 0;
  bool has_replacement_ = false;  // the source has a character for U+FFFD, with the code replacement_

  std::string text_;     // not yet converted: of a cut character
  uint64_t offset_ = 0;  // in the input
  uint64_t record_ = 1;
  LXShiftState state_ = LX_SHIFT_SINGLE;
  size_t window_bytes_;  // of the next part that is tried as a whole
  Place place_;
  std::vector<LXUChar> units_;
  size_t unit_count_ = 0;
  std::vector<char> encoded_;  // the units, in the source again

  LXShiftState target_state_ = LX_SHIFT_SINGLE;
  std::vector<char> out_;
  size_t out_used_ = 0;
};

}  // namespace lexicor_cli
