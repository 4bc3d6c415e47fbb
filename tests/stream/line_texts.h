// Random texts full of line ends of every kind, and a model of line ends that works on characters.
#pragma once

#include "support/case_test.h"

namespace lx::test {

inline Units random_text(const TinyCodepage& cp, std::mt19937& random, size_t most) {
  const Units ends = line_ends(cp), often = ends.substr(0, 2);
  Units alphabet = ends + often + often + LXUChar(cp.characters.back().unicode), text(random() % most, 0);
  for (size_t i = 0; i < cp.characters.size(); i += cp.characters.size() / 7)
    alphabet.push_back(cp.characters[i].unicode);
  for (LXUChar& u : text) u = alphabet[random() % alphabet.size()];
  return text;
}

struct FoundEol {
  size_t past;  // characters up to and with it
  uint32_t kind;
  int32_t length;
};
/// The line ends one after the other at each character, in the order in which they are looked for.
inline FoundEol find_eol(const Units& ends, const Units& text, size_t from, uint32_t kinds) {
  for (size_t i = from; i < text.size(); ++i) {
    const bool pair = text[i] == ends[1] && i + 1 < text.size() && text[i + 1] == ends[0];
    if ((kinds & LX_EOL_CRLF) != 0 && pair) return {i + 2, LX_EOL_CRLF, 2};
    for (const auto& [kind, end] : {std::pair{LX_EOL_LF, 0}, {LX_EOL_THIRD, 2}, {LX_EOL_FOURTH, 3}})
      if ((kinds & kind) != 0 && text[i] == ends[static_cast<size_t>(end)]) return {i + 1, kind, 1};
  }
  return {text.size(), LX_EOL_NONE, 0};
}

}  // namespace lx::test
