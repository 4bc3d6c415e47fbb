#include "support/sort_builder.h"

#include "core/lxbytes.h"
#include "core/lxformat.h"

namespace lx::test {

namespace fmt = lx::format::sort;

namespace {

void append16(ByteString* bytes, unsigned value) {
  bytes->push_back(static_cast<uint8_t>(value));
  bytes->push_back(static_cast<uint8_t>(value >> 8));
}

void append_weight(ByteString* bytes, const TestWeight& weight, unsigned flags) {
  const LXWeights& w = weight.weights;
  append16(bytes, w.special != 0 ? w.special : w.primary);
  bytes->push_back(w.secondary);
  bytes->push_back(w.tertiary);
  append16(bytes, flags | (w.special != 0 ? fmt::WeightRecord::kSpecial : 0u) |
                      static_cast<unsigned>(weight.char_class << fmt::WeightRecord::kClassShift));
}

}  // namespace

ByteString SortBuilder::payload() const {
  ByteString bytes(fmt::kFixedBytes);
  bytes[fmt::kDefaultSecondary] = default_secondary;
  bytes[fmt::kDefaultTertiary] = default_tertiary;
  put_le16(&bytes[fmt::kExpansionCount], static_cast<uint16_t>(expansions.size()));
  put_le16(&bytes[fmt::kContractionCount], static_cast<uint16_t>(pairs.size()));
  std::map<uint8_t, uint16_t> bases;
  for (const auto& entry : characters) bases[static_cast<uint8_t>(entry.first >> 8)] = 0;
  for (const auto& entry : expansions) bases[static_cast<uint8_t>(entry.first >> 8)] = 0;
  put_le16(&bytes[fmt::kWeights], static_cast<uint16_t>(bytes.size()));
  uint16_t records = 0;
  for (auto& [page, base] : bases) {
    base = records;
    for (unsigned low = 0; low < 256; ++low, ++records) {
      const auto u = static_cast<LXUChar>(page << 8 | low);
      const auto expansion = expansions.find(u);
      const auto character = characters.find(u);
      if (expansion != expansions.end())
        append_weight(&bytes, {{}, expansion->second.first.char_class}, fmt::WeightRecord::kExpansion);
      else
        append_weight(&bytes, character != characters.end() ? character->second : TestWeight{}, 0);
    }
  }
  for (unsigned page = 0; page < 256; ++page) {
    uint8_t* entry = &bytes[fmt::kPages + fmt::Page::kBytes * page];
    const auto number = static_cast<uint8_t>(page);
    entry[0] = fmt::kPageUncovered;
    if (const auto base = bases.find(number); base != bases.end()) {
      entry[0] = 0;
      put_le16(entry + 2, base->second);
    } else if (const auto found = computed.find(number); found != computed.end()) {
      entry[0] = found->second.flags;
      entry[1] = found->second.char_class;
      put_le16(entry + 2, found->second.base);
    }
  }
  put_le16(&bytes[fmt::kExpansions], static_cast<uint16_t>(bytes.size()));
  for (const auto& [u, sets] : expansions) {
    append16(&bytes, u);
    for (const LXWeights& w : {sets.first.weights, sets.second}) {
      append16(&bytes, w.primary);
      bytes.push_back(w.secondary);
      bytes.push_back(w.tertiary);
    }
    append16(&bytes, 0);
    append16(&bytes, 0);
  }
  put_le16(&bytes[fmt::kContractions], static_cast<uint16_t>(bytes.size()));
  for (const Pair& pair : pairs) {
    append16(&bytes, pair.first);
    append16(&bytes, pair.second);
    append_weight(&bytes, pair.weight, 0);
  }
  return bytes;
}

}  // namespace lx::test
