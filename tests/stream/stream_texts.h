// Texts of the small codepages in all forms, full of line ends of every kind, a model of line ends that works
// on characters, and the far end of a stream.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <random>

#include "core/lxformat.h"
#include "lx.h"
#include "support/tiny_codepages.h"

namespace lx::test {

using Text = std::vector<TinyCharacter>;

/// The small codepages with four different line-end bytes.
inline std::vector<TinyCodepage> line_codepages() {
  std::vector<TinyCodepage> all = tiny_codepages();
  for (TinyCodepage& cp : all) {
    const uint8_t ascii[] = {0x0A, 0x0D, 0x0B, 0x0C};
    const uint8_t shift[] = {0x25, 0x02, 0x03, 0x01};
    uint8_t* const ends = cp.file.sections[0].data() + format::codepage::kLineEnds;
    std::copy_n(cp.shift ? shift : ascii, 4, ends);
  }
  return all;
}

/// The codes of line feed, carriage return and the two further line ends.
inline const uint8_t* line_ends(const TinyCodepage& cp) {
  return cp.file.sections[0].data() + format::codepage::kLineEnds;
}

inline Text random_text(const TinyCodepage& cp, std::mt19937& random, size_t most) {
  Text alphabet;
  for (const TinyCharacter& c : cp.characters)
    for (size_t i = 0; i < 4; ++i)
      if (c.code == line_ends(cp)[i]) alphabet.insert(alphabet.end(), i < 2 ? 3 : 1, c);
  const size_t step = cp.characters.size() / 7;
  for (size_t i = 0; i < cp.characters.size(); i += step) alphabet.push_back(cp.characters[i]);
  alphabet.push_back(cp.characters.back());
  Text text(random() % most);
  for (TinyCharacter& c : text) c = alphabet[random() % alphabet.size()];
  return text;
}

struct FoundEol {
  size_t past;  // characters up to and with it
  uint32_t kind;
  int32_t length;
};
/// The line ends one after the other at each character, in the order in which they are looked for.
inline FoundEol find_eol(const TinyCodepage& cp, const Text& text, size_t from, uint32_t kinds) {
  const uint8_t* const ends = line_ends(cp);
  for (size_t i = from; i < text.size(); ++i) {
    const bool pair = text[i].code == ends[1] && i + 1 < text.size() && text[i + 1].code == ends[0];
    if ((kinds & LX_EOL_CRLF) != 0 && pair) return {i + 2, LX_EOL_CRLF, 2};
    for (const auto& [kind, end] : {std::pair{LX_EOL_LF, 0}, {LX_EOL_THIRD, 2}, {LX_EOL_FOURTH, 3}})
      if ((kinds & kind) != 0 && text[i].code == ends[end]) return {i + 1, kind, 1};
  }
  return {text.size(), LX_EOL_NONE, 0};
}

inline std::vector<Text> lines_of(const TinyCodepage& cp, const Text& text, uint32_t flags) {
  std::vector<Text> lines;
  for (size_t at = 0; at < text.size();) {
    const size_t past = find_eol(cp, text, at, flags & LX_EOL_ALL).past;
    Text line;
    for (; at < past; ++at) {
      const bool pair =
          at + 1 < past && text[at].code == line_ends(cp)[1] && text[at + 1].code == line_ends(cp)[0];
      if (!pair || (flags & LX_DROP_RETURNS) == 0) line.push_back(text[at]);
    }
    lines.push_back(line);
  }
  return lines;
}

// How a text stands in memory; the Ex form begins and ends in the single-byte state.

inline std::vector<char> plain_bytes(const TinyCodepage&, const Text& text) {
  std::vector<char> bytes;
  for (const TinyCharacter& c : text) bytes.insert(bytes.end(), c.bytes.begin(), c.bytes.end());
  return bytes;
}
inline std::vector<LXWChar> codes(const TinyCodepage&, const Text& text) {
  std::vector<LXWChar> codes;
  for (const TinyCharacter& c : text) codes.push_back(c.code);
  return codes;
}
inline std::vector<LXUChar> units(const TinyCodepage&, const Text& text) {
  std::vector<LXUChar> units;
  for (const TinyCharacter& c : text) units.push_back(c.unicode);
  return units;
}
inline std::vector<char> closed_bytes(const TinyCodepage& cp, const Text& text) {
  LXShiftState state = LX_SHIFT_SINGLE;
  std::string bytes = cp.encode(units(cp, text), &state);
  if (state == LX_SHIFT_DOUBLE) bytes += cp.shift_in;
  return {bytes.begin(), bytes.end()};
}

inline constexpr int32_t kAll = 1000;       // moves what it is asked to
inline constexpr int32_t kNonsense = 2000;  // claims more than that

/// The far end of a stream: what each call does, and behind the script all that is asked for.
struct Peer {
  std::string bytes;  // what a write stream sent, or what a read stream is to get
  std::vector<int32_t> script;
  size_t calls = 0;
  size_t given = 0;

  static int32_t transfer(void* user, char* buffer, int32_t wanted) {
    Peer& peer = *static_cast<Peer*>(user);
    const int32_t step = peer.calls < peer.script.size() ? peer.script[peer.calls] : kAll;
    ++peer.calls;
    EXPECT_GE(wanted, 1);
    if (step == kNonsense) return wanted + 1;
    return step < 0 ? step : peer.move(buffer, std::min(step, wanted));
  }
  virtual ~Peer() = default;
  virtual int32_t move(char* buffer, int32_t count) = 0;
};
struct Sender : Peer {
  int32_t move(char* buffer, int32_t count) override {
    const size_t n = std::min(static_cast<size_t>(count), bytes.size() - given);
    bytes.copy(buffer, n, given);
    given += n;
    return static_cast<int32_t>(n);
  }
};
struct Receiver : Peer {
  int32_t move(char* buffer, int32_t count) override {
    bytes.append(buffer, static_cast<size_t>(count));
    return count;
  }
};

/// The doors of the four forms under one name each.
template <class U, auto kEncode, auto kRead, auto kGetEol, auto kPutEol>
struct Form {
  using Unit = U;
  static constexpr auto encode = kEncode;
  static constexpr auto read = kRead;
  static constexpr auto get_eol = kGetEol;
  static constexpr auto put_eol = kPutEol;
};
using Plain = Form<char, plain_bytes, LXReadString, LXGetEol, LXPutEol>;
using Ex = Form<char, closed_bytes, LXReadStringEx, LXGetEolEx, LXPutEolEx>;
using Wide = Form<LXWChar, codes, LXReadStringW, LXGetEolW, LXPutEolW>;
using Unicode = Form<LXUChar, units, LXReadStringU, LXGetEolU, LXPutEolU>;

/// Calls `check` with each form.
template <class Check>
void in_all_forms(Check check) {
  check(Plain{});
  check(Ex{});
  check(Wide{});
  check(Unicode{});
}

/// The bytes that a stream of this form carries.
template <class F>
std::string stream_bytes(const TinyCodepage& cp, const Text& text) {
  const auto bytes = closed_bytes(cp, text);
  if (!std::is_same_v<F, Unicode>) return {bytes.begin(), bytes.end()};
  const auto all = units(cp, text);
  return {reinterpret_cast<const char*>(all.data()), all.size() * sizeof(LXUChar)};
}

}  // namespace lx::test
