// Converts a file of records of a fixed length.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

#include "codepage.h"
#include "output.h"
#include "recoder.h"

namespace lexicor_cli {

/// The text of one record, which it brings to its length.
class RecordSink : public Sink {
 public:
  /// `bytes` of a record; `cuts`: what does not fit is cut off, else it is refused.
  RecordSink(const Codepage& codepage, size_t bytes, bool cuts, Output& output);

  using Sink::write;
  void write(const char* data, size_t bytes) override { text_.append(data, bytes); }
  /// Writes the record, filled up with blanks. Blanks at its end need not fit. Throws a Failure for others that do not.
  void end();
  /// How many records were cut.
  uint64_t cut() const { return cut_; }

 private:
  size_t char_bytes(size_t at, LXShiftState state) const;
  size_t fitting() const;
  void drop_blanks();

  const Codepage& codepage_;
  const size_t bytes_;
  const bool cuts_;
  Output& output_;
  const char blank_;
  std::string text_;
  uint64_t number_ = 1, cut_ = 0;
};

/// Parts a text into records for a Recoder that writes to a RecordSink.
class RecordReader {
 public:
  RecordReader(size_t bytes, Recoder& recoder, RecordSink& sink)
      : bytes_(bytes), recoder_(recoder), sink_(sink) {}

  void take(const char* data, size_t bytes);
  /// Throws a Failure where the text has ended inside a record.
  void finish() const;

 private:
  const size_t bytes_;
  Recoder& recoder_;
  RecordSink& sink_;
  size_t taken_ = 0;  // of the record that is read
  uint64_t number_ = 1;
};

}  // namespace lexicor_cli
