// The damaged forms of a file, by number.
#pragma once

#include <string>

#include "support/object_files.h"

namespace mutate {

using lx::test::ByteString;

/// Every byte set to 00, FF, one more, one less and with its top bit changed; every field of 16 and of 32 bits at an
/// even place set to boundary values; the file cut at every length; and places changed at random, by a seed.
class Mutants {
 public:
  Mutants(ByteString whole, bool big_endian, uint32_t seed, size_t random_changes);

  size_t count() const { return bytes_ + words_ + longs_ + cuts_ + random_; }
  /// The mutant. False where it is the file as it was, or another mutant.
  bool make(size_t number, ByteString* mutant) const;
  /// What is changed, and where.
  std::string name(size_t number) const;
  const ByteString& whole() const { return whole_; }

 private:
  struct Change {
    size_t at;
    size_t bytes;  // of the field; 0: cut here
    uint32_t value;
  };
  uint32_t value(size_t at, size_t bytes, size_t which) const;
  Change change(size_t number) const;
  bool is_of_half(const Change& change) const;
  uint32_t field(size_t at, size_t bytes) const;
  void put(ByteString* file, const Change& change) const;
  void change_at_random(size_t number, ByteString* mutant) const;

  ByteString whole_;
  bool big_endian_;
  uint32_t seed_;
  size_t bytes_, words_, longs_, cuts_, random_;  // mutants of each sort
};

}  // namespace mutate
