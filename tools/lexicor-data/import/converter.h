// One codepage table of another system, asked a character at a time. What ICU and iconv answer is brought to
// one form here, so that the importer enumerates both alike.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "codepage_table.h"

namespace lexicor_import {

using Bytes = std::vector<uint8_t>;

enum class Decoding {
  kCharacter,  ///< the bytes are one character
  kSequence,   ///< the bytes are one unit but several code points
  kCut,        ///< the bytes begin a longer character
  kNone        ///< the bytes are not assigned, or are no character
};

class Converter {
 public:
  virtual ~Converter() = default;

  /// What `bytes` mean, standing alone. In a shift-stateful converter the caller gives the shift bytes too.
  virtual Decoding decode(const Bytes& bytes, uint32_t& unicode) = 0;
  /// The bytes of a code point, fallbacks included, with shift bytes; empty when there are none.
  virtual Bytes encode(uint32_t unicode) = 0;
  virtual bool is_shift_stateful() const = 0;
  /// The system, its version and the table, for the source's header.
  virtual std::string description() const = 0;
};

/// Throws std::runtime_error when the table does not exist.
std::unique_ptr<Converter> open_converter(const Codepage& codepage);

}  // namespace lexicor_import
