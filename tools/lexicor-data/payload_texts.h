// The texts of a language or territory payload: a header of 16-bit words, some of which are the byte offsets of
// null-terminated texts behind it.
#pragma once

#include <string>

#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "object_file.h"
#include "ucm.h"

namespace lexicor_data {

inline void put_word(ByteVector& payload, size_t word, size_t value) {
  lx::put_le16(&payload[2 * word], static_cast<uint16_t>(value));
}
inline uint16_t word_at(const ByteVector& payload, size_t word) {
  return lx::le16(&payload[2 * word]);
}

/// Appends a text and stores its offset in a word.
inline void append_text(ByteVector& payload, size_t word, const std::u16string& text) {
  put_word(payload, word, payload.size());
  for (char16_t unit : text) append_le16(payload, unit);
  append_le16(payload, 0);
}

inline std::u16string text_at(const ByteVector& payload, size_t word) {
  std::u16string text;
  for (size_t at = word_at(payload, word); lx::le16(&payload[at]) != 0; at += 2) {
    text.push_back(static_cast<char16_t>(lx::le16(&payload[at])));
  }
  return text;
}

inline void require_payload_fits(const ByteVector& payload, const std::string& file_name) {
  if (payload.size() > lx::format::kMaxSectionBytes) {
    throw SourceError(file_name, 0, 0, "the texts take more than 65,535 bytes");
  }
}

}  // namespace lexicor_data
