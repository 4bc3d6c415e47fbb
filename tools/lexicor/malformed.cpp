// UTF-8 is checked by the ranges of its bytes: malformed bytes are counted as Unicode recommends, by the
// longest beginnings of characters. In other codepages only what has no Unicode value can be malformed: text is
// converted as a whole, and where a value is missing its characters are looked at one by one.
#include "malformed.h"

#include <algorithm>
#include <cstdint>
#include <cstring>

#include "byte_vector.h"
#include "character_values.h"
#include "hex.h"

namespace lexicor_cli {

namespace {

constexpr size_t kFirstWindowBytes = 64;
constexpr size_t kLastWindowBytes = 64 * 1024;

/// What a lead byte of UTF-8 wants: the bytes of the character, 0 for a byte that begins none, and the range of
/// the second one. The others are 80 to BF.
struct Utf8Lead {
  size_t bytes;
  uint8_t low, high;
};

Utf8Lead utf8_lead(uint8_t byte) {
  if (byte < 0x80) return {1, 0, 0};
  if (byte < 0xC2 || byte > 0xF4) return {0, 0, 0};
  const auto low = static_cast<uint8_t>(byte == 0xE0 ? 0xA0 : byte == 0xF0 ? 0x90 : 0x80);
  const auto high = static_cast<uint8_t>(byte == 0xED ? 0x9F : byte == 0xF4 ? 0x8F : 0xBF);
  return {byte < 0xE0 ? 2u : byte < 0xF0 ? 3u : 4u, low, high};
}

bool fits(const Utf8Lead& lead, size_t at, uint8_t byte) {
  return at == 1 ? byte >= lead.low && byte <= lead.high : (byte & 0xC0) == 0x80;
}

/// The bytes at `text` that go together as the beginning of one character, at least 1.
size_t utf8_beginning(const char* text, size_t bytes, const Utf8Lead& lead) {
  size_t count = 1;
  while (count < lead.bytes && count < bytes && fits(lead, count, static_cast<uint8_t>(text[count]))) ++count;
  return count;
}

/// Whether a block goes on with characters of up to three bytes. What it begins with depends on the two bytes in front of
/// it; its last character may be cut. Every byte is looked at with those before it, in the same way.
constexpr size_t kBlock = 64;
bool short_utf8_goes_on(const uint8_t* block) {
  ByteVector wrong{};
  for (size_t i = 0; i < kBlock; i += sizeof wrong) {
    const ByteVector byte = load_bytes(block + i), before = load_bytes(block + i - 1),
                     second_before = load_bytes(block + i - 2);
    const auto trails = (byte & 0xC0) == 0x80;
    const auto follows = (before >= 0xC0) | (second_before >= 0xE0);
    // Below A0 it could be shorter, and from A0 on behind ED it is a surrogate.
    const auto out_of_range = ((before == 0xE0) & (byte < 0xA0)) | ((before == 0xED) & (byte >= 0xA0));
    const auto no_lead = (byte >= 0xF0) | ((byte & 0xFE) == 0xC0);
    wrong |= reinterpret_cast<ByteVector>((trails ^ follows) | out_of_range | no_lead);
  }
  return !any(wrong);
}

/// Well-formed characters of up to three bytes at the start of a text; the last bytes are left over.
size_t short_utf8_bytes(const char* text, size_t bytes) {
  const auto* const start = reinterpret_cast<const uint8_t*>(text);
  const uint8_t* const end = start + bytes;
  const uint8_t* p = start;
  const uint8_t* next_block = start + 2;  // where blocks are tried again
  const auto trail = [](uint8_t byte) { return (byte & 0xC0) == 0x80; };
  uint64_t word;
  while (static_cast<size_t>(end - p) >= sizeof word) {
    if (p >= next_block && static_cast<size_t>(end - p) >= kBlock) {
      const uint8_t* const from = p;
      while (static_cast<size_t>(end - p) >= kBlock && short_utf8_goes_on(p)) p += kBlock;
      if (p != from) p -= p[-1] >= 0xC0 ? 1 : p[-2] >= 0xE0 ? 2 : 0;
      next_block = p + kBlock;
      continue;
    }
    if (*p < 0x80) {
      std::memcpy(&word, p, sizeof word);
      p += (word & 0x8080808080808080u) == 0 ? sizeof word : 1;
    } else if (*p >= 0xC2 && *p <= 0xDF && trail(p[1])) {
      p += 2;
    } else if ((*p & 0xF0) == 0xE0 && trail(p[1]) && trail(p[2])) {
      // Below 0x20 it could be shorter, and a surrogate has the upper five bits of 0xD800.
      const unsigned upper = (*p & 0x0Fu) << 6 | (p[1] & 0x3Fu);
      if (upper < 0x20 || upper >> 5 == 0xD800 >> 11) break;
      p += 3;
    } else {
      break;
    }
  }
  return static_cast<size_t>(p - start);
}

}  // namespace

MalformedFinder::MalformedFinder(const Codepage& codepage, bool long_utf8_ends)
    : codepage_(codepage), long_utf8_ends_(long_utf8_ends) {}

Stretch MalformedFinder::next(const char* text, size_t bytes, LXShiftState state, bool last) const {
  if (codepage_.utf8()) return next_utf8(text, bytes, last);
  if (codepage_.single_byte()) return {bytes, 0, Stretch::End::kText};
  // What stands behind malformed bytes is looked at again, so the windows begin small.
  size_t good = 0, window = kFirstWindowBytes;
  for (bool whole_call = false; !whole_call; window = std::min(2 * window, kLastWindowBytes)) {
    const size_t most = std::min(window, bytes - good);
    const size_t size = codepage_.call_bytes(text + good, most);
    const bool rest = size == bytes - good;
    whole_call = rest || size < most ||
                 (codepage_.is_shift(text[good + size - 1]) && codepage_.is_shift(text[good + size]));
    LXShiftState end_state = state;
    const size_t whole = codepage_.whole_bytes(text + good, size, state, &end_state);
    if (!has_values(text + good, whole, state) || (rest && last && whole < size)) {
      const Stretch stretch = walk(text + good, size, state, rest && last);
      if (stretch.end != Stretch::End::kText)
        return {good + stretch.good_bytes, stretch.end_bytes, stretch.end};
    }
    good += whole;
    state = end_state;
  }
  return {good, 0, Stretch::End::kText};
}

Stretch MalformedFinder::next_utf8(const char* text, size_t bytes, bool last) const {
  size_t at = 0;
  while (at < bytes) {
    at += short_utf8_bytes(text + at, bytes - at);
    if (at == bytes) break;
    const Utf8Lead lead = utf8_lead(static_cast<uint8_t>(text[at]));
    const size_t count = utf8_beginning(text + at, bytes - at, lead);
    if (count != lead.bytes) {
      const bool cut = lead.bytes != 0 && count == bytes - at;
      if (cut && !last) break;
      return {at, count, Stretch::End::kMalformed};
    }
    if (count == kLongUtf8Bytes && long_utf8_ends_) return {at, count, Stretch::End::kLongUtf8};
    at += count;
  }
  return {at, 0, Stretch::End::kText};
}

bool MalformedFinder::has_values(const char* text, size_t bytes, LXShiftState state) const {
  if (units_.size() < bytes) units_.resize(bytes);
  const auto length = static_cast<int32_t>(bytes);
  LXUChar* const units = units_.data();
  LXUChar* const end = units + LXStringToUnicodeEx(units, length, codepage_.locale(), text, state, length, 0);
  return std::find(units, end, kReplacement) == end;
}

Stretch MalformedFinder::walk(const char* text, size_t bytes, LXShiftState state, bool last) const {
  size_t at = 0;
  for (;;) {
    if (at < bytes && codepage_.is_shift(text[at])) state = codepage_.state_after(text[at++]);
    if (at == bytes) return {at, 0, Stretch::End::kText};
    const auto wanted = static_cast<size_t>(codepage_.char_bytes(text + at, state));
    const size_t bad = malformed_bytes(text + at, bytes - at, wanted, state);
    const bool cut = wanted > bytes - at;
    if (cut && bad == bytes - at && !last) return {at, 0, Stretch::End::kText};
    if (cut || bad != 0) return {at, bad, Stretch::End::kMalformed};
    at += wanted;
  }
}

/// The bytes at `text` that are no whole character; 0 when the character is whole and may have a value.
size_t MalformedFinder::malformed_bytes(const char* text, size_t bytes, size_t char_bytes,
                                        LXShiftState state) const {
  if (char_bytes == 1) return 0;
  learn_bytes();
  if (state == LX_SHIFT_DOUBLE && !first_bytes_[static_cast<uint8_t>(*text)]) return 1;
  size_t good = 1;
  while (good < char_bytes && good < bytes && trail_bytes_[static_cast<uint8_t>(text[good])]) ++good;
  return good == char_bytes ? 0 : good;
}

void MalformedFinder::learn_bytes() const {
  if (learned_) return;
  learned_ = true;
  const LXShiftState state = codepage_.shift_sensitive() ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
  for (unsigned first = 0; first < 256; ++first) {
    const char text = static_cast<char>(first);
    if (codepage_.is_shift(text) || codepage_.char_bytes(&text, state) != 2) continue;
    for (unsigned trail = 0; trail < 256; ++trail) {
      if (LXCpMbToUnicodeW(codepage_.object(), first << 8 | trail) == kReplacement) continue;
      first_bytes_.set(first);
      trail_bytes_.set(trail);
    }
  }
}

std::string MalformedFinder::describe(const char* text, size_t malformed_bytes, const char* end,
                                      LXShiftState state) const {
  const std::string bad = (malformed_bytes == 1 ? "byte " : "bytes ") + hex_bytes({text, malformed_bytes});
  const std::string not_text = bad + (malformed_bytes == 1 ? " is not " : " are not ") + codepage_.name();
  const char* const behind = text + malformed_bytes;
  const std::string found = behind == end ? "the text ends" : "there is " + hex_bytes({behind, 1});
  if (codepage_.utf8()) {
    const Utf8Lead lead = utf8_lead(static_cast<uint8_t>(*text));
    if (lead.bytes == 0)
      return not_text + (is_utf8_trail(*text) ? ": it continues a character, and none begins before it"
                                              : ": no character has it");
    const bool second = malformed_bytes == 1;
    return not_text + ": " + hex_text(second ? lead.low : 0x80, 2) + " to " +
           hex_text(second ? lead.high : 0xBF, 2) + " must follow, but " + found;
  }
  learn_bytes();
  if (state == LX_SHIFT_DOUBLE) {
    if (!first_bytes_[static_cast<uint8_t>(*text)])
      return not_text + " in the double-byte state: no character begins with it";
    return not_text + " in the double-byte state: a second byte must follow, but " + found;
  }
  return not_text + ": " + (malformed_bytes == 1 ? "a trail byte" : "one more trail byte") +
         " must follow, but " + found;
}

}  // namespace lexicor_cli
