// Words that are compared, sorted and made into keys.
#pragma once

#include <algorithm>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "table.h"

namespace bench {

struct Word {
  std::u16string units;
  std::string utf8;
};
using Words = std::shared_ptr<const std::vector<Word>>;

/// What is done with a comparison.
enum class Order {
  kNeighbours,  // each word is compared with the next one
  kSort,        // all are sorted
};

/// The work of a comparison, below 0, 0 or above 0, on words. Gives a digest of what it found.
template <class Compare>
Work order_work(Order order, const Words& words, Compare compare) {
  if (order == Order::kNeighbours)
    return [words, compare](char*) {
      size_t less = 1;
      for (size_t i = 1; i < words->size(); ++i) less += compare((*words)[i - 1], (*words)[i]) < 0;
      return less;
    };
  return [words, compare](char*) {
    std::vector<const Word*> sorted;
    for (const Word& word : *words) sorted.push_back(&word);
    std::sort(sorted.begin(), sorted.end(), [&](const Word* a, const Word* b) { return compare(*a, *b) < 0; });
    size_t digest = 1;
    for (const Word* const word : sorted) digest = 31 * digest + static_cast<size_t>(word - words->data());
    return digest;
  };
}

/// The work of `key(word, output)`, which gives the bytes of a key, on each word. Gives their sum.
template <class Key>
Work key_work(const Words& words, Key key) {
  return [words, key](char* out) mutable {
    size_t bytes = 0;
    for (const Word& word : *words) bytes += key(word, out);
    return bytes;
  };
}
inline constexpr int32_t kKeyBytes = 1024;

/// The work of `finds(text, part)` for a part that does not occur in the text, which it reads to its end.
template <class Finds>
Work find_work(const std::shared_ptr<const std::u16string>& text, Finds finds) {
  return [text, finds](char*) { return size_t{1} + finds(*text, std::u16string(u"not to be found")); };
}

}  // namespace bench
