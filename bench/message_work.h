// Messages that are fetched by number.
#pragma once

#include <vector>

#include "table.h"

namespace bench {

/// Bytes for a message with its null.
inline constexpr int32_t kMessageRoom = 128;

/// The work of `fetch(number, output)` for each number; each has an output of kMessageRoom bytes.
template <class Fetch>
Work message_work(const std::vector<int>& numbers, Fetch fetch) {
  return [numbers, fetch](char* output) {
    char* out = output;
    for (const int number : numbers) {
      fetch(number, out);
      out += kMessageRoom;
    }
    return static_cast<size_t>(out - output);
  };
}

}  // namespace bench
