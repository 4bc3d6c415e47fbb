#include "support/sort_builder.h"

#include "core/lxformat.h"
#include "sort_pack.h"

namespace lx::test {

namespace so = lx::format::sort;

ByteString SortBuilder::payload() const {
  using lexicor_data::SortElement;
  using lexicor_data::SortPageKind;
  const auto set_of = [](const LXWeights& w) {
    return lexicor_data::SortSet{w.primary, w.secondary, w.tertiary, w.special};
  };
  lexicor_data::SortSource sort;
  sort.default_secondary = default_secondary;
  sort.default_tertiary = default_tertiary;
  for (const auto& [page, found] : computed) sort.pages[page] = found;
  const auto add = [&](LXUChar u, uint8_t count, const TestWeight& weight, const LXWeights& second) {
    sort.pages[u >> 8].kind = SortPageKind::kTable;
    sort.characters[u] = {{set_of(weight.weights), set_of(second)}, count, weight.char_class, {}};
  };
  for (const auto& [u, weight] : characters) add(u, 1, weight, {});
  for (const auto& [u, sets] : expansions) add(u, 2, sets.first, sets.second);
  ByteString bytes = pack_sort(sort, "a test's sort");
  // Pairs in any order and more than once, which the compiler would not write: their table is the last one.
  put_le16(&bytes[so::kContractionCount], static_cast<uint16_t>(pairs.size()));
  for (const Pair& pair : pairs) {
    const LXWeights& w = pair.weight.weights;
    const unsigned flags = (w.special != 0 ? so::WeightRecord::kSpecial : 0u) |
                           static_cast<unsigned>(pair.weight.char_class << so::WeightRecord::kClassShift);
    const uint16_t weight = w.special != 0 ? w.special : w.primary;
    const so::WeightRecord record{weight, w.secondary, w.tertiary, static_cast<uint16_t>(flags)};
    lexicor_data::append_record(bytes, so::Contraction{pair.first, pair.second, record});
  }
  return bytes;
}

}  // namespace lx::test
