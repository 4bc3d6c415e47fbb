// Sort objects made by a test.
#pragma once

#include <map>
#include <utility>
#include <vector>

#include "lx.h"
#include "sort_text.h"
#include "support/object_files.h"

namespace lx::test {

constexpr uint8_t kAppendAll = 15;

struct TestWeight {
  LXWeights weights{};  // a special weight excludes the others
  uint8_t char_class = kAppendAll;
};

/// The payload of a sort. Characters of a page that has one but that are not set have no weights; other pages
/// are not covered unless they are computed.
struct SortBuilder {
  struct Pair {
    LXUChar first, second;
    TestWeight weight;
  };

  uint8_t default_secondary = 1;
  uint8_t default_tertiary = 1;
  std::map<LXUChar, TestWeight> characters;
  std::map<LXUChar, std::pair<TestWeight, LXWeights>> expansions;  // first and second set
  std::vector<Pair> pairs;
  std::map<uint8_t, lexicor_data::SortPage> computed;

  ByteString payload() const;
};

}  // namespace lx::test
