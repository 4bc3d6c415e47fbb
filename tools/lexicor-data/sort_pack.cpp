// The layout of a sort's payload: fixed part, weight records, expansions, contractions, in this order. Tables
// are in ascending order of their characters.
#include "sort_pack.h"

#include <algorithm>
#include <vector>

#include "core/lxbytes.h"
#include "row_packer.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

namespace layout = lx::format::sort;

/// A weight record as one number: weight, secondary, tertiary and flags, the lowest bits first.
using Record = uint64_t;

uint16_t flags_of(const SortElement& element) {
  unsigned flags = static_cast<unsigned>(element.char_class) << layout::kWeightClassShift;
  if (element.count == 2) flags |= layout::kWeightExpansion;
  if (element.count == 1 && element.sets[0].special != 0) flags |= layout::kWeightSpecial;
  return static_cast<uint16_t>(flags);
}

uint16_t weight_of(const SortSet& set) {
  return set.special != 0 ? set.special : set.primary;
}

Record record_of(const SortElement& element) {
  if (element.ignored()) return 0;
  const Record flags = Record{flags_of(element)} << 32;
  if (element.count == 2) return flags;
  const SortSet& set = element.sets[0];
  return flags | Record{set.tertiary} << 24 | Record{set.secondary} << 16 | weight_of(set);
}

void append_record(ByteVector& out, Record record) {
  for (size_t i = 0; i < layout::kWeightBytes; ++i) out.push_back(static_cast<uint8_t>(record >> 8 * i));
}

void append_set(ByteVector& out, const SortSet& set) {
  append_le16(out, set.primary);
  out.push_back(set.secondary);
  out.push_back(set.tertiary);
}

SortSet set_at(const ByteVector& payload, size_t at) {
  return {lx::le16(&payload[at]), payload[at + 2], payload[at + 3], 0};
}

/// The weights of a weight record, or of a contraction record behind its characters.
SortElement element_at(const ByteVector& payload, size_t at) {
  SortElement element;
  const uint16_t flags = lx::le16(&payload[at + 4]);
  element.char_class = static_cast<uint8_t>((flags & layout::kWeightClass) >> layout::kWeightClassShift);
  SortSet& set = element.sets[0];
  if ((flags & layout::kWeightSpecial) != 0) {
    set.special = lx::le16(&payload[at]);
  } else {
    set = set_at(payload, at);
  }
  return element;
}

/// The rows of the table pages, packed; the base of each into the page table.
std::vector<Record> pack_rows(const SortSource& sort, std::array<uint16_t, 256>& bases) {
  using Packer = RowPacker<Record>;
  std::vector<Packer::Request> requests;
  std::vector<size_t> numbers;
  for (size_t number = 0; number < sort.pages.size(); ++number) {
    if (sort.pages[number].kind != SortPageKind::kTable) continue;
    Packer::Row row(256);
    for (size_t low = 0; low < row.size(); ++low) {
      const auto found = sort.characters.find(static_cast<char16_t>(number << 8 | low));
      if (found != sort.characters.end()) row[low] = record_of(found->second);
    }
    requests.push_back({std::move(row), 0});
    numbers.push_back(number);
  }
  Packer packer(0);
  const std::vector<size_t> positions = packer.place(requests);
  for (size_t i = 0; i < numbers.size(); ++i) bases[numbers[i]] = static_cast<uint16_t>(positions[i]);
  return packer.pool();
}

constexpr uint8_t kPageFlags[] = {layout::kPageUncovered, 0, layout::kPagePrimary, layout::kPageSpecial};

}  // namespace

ByteVector pack_sort(const SortSource& sort, const std::string& file_name) {
  std::array<uint16_t, 256> bases{};
  ByteVector weights, expansions, contractions;
  for (Record record : pack_rows(sort, bases)) append_record(weights, record);
  for (const auto& [character, element] : sort.characters) {
    if (element.count != 2) continue;
    append_le16(expansions, character);
    for (const SortSet& set : element.sets) append_set(expansions, set);
    append_le32(expansions, 0);
  }
  for (const auto& [pair, element] : sort.contractions) {
    append_le16(contractions, pair.first);
    append_le16(contractions, pair.second);
    append_record(contractions, Record{flags_of(element)} << 32 | record_of(element));
  }

  const size_t bytes = layout::kFixedBytes + weights.size() + expansions.size() + contractions.size();
  if (bytes > lx::format::kMaxSectionBytes) {
    throw SourceError(file_name, 0, 0,
                      "the payload takes " + std::to_string(bytes) + " bytes, more than 65535: weights " +
                          std::to_string(weights.size()) + ", expansions " + std::to_string(expansions.size()) +
                          ", contractions " + std::to_string(contractions.size()));
  }
  ByteVector payload(layout::kFixedBytes);
  payload[layout::kDefaultSecondary] = sort.default_secondary;
  payload[layout::kDefaultTertiary] = sort.default_tertiary;
  auto put = [&](size_t at, size_t value) { lx::put_le16(&payload[at], static_cast<uint16_t>(value)); };
  put(layout::kExpansionCount, expansions.size() / layout::kExpansionBytes);
  put(layout::kContractionCount, contractions.size() / layout::kContractionBytes);
  for (size_t number = 0; number < sort.pages.size(); ++number) {
    const SortPage& page = sort.pages[number];
    const size_t at = layout::kPages + layout::kPageBytes * number;
    payload[at] = kPageFlags[static_cast<size_t>(page.kind)];
    if (page.computed()) payload[at + 1] = page.char_class;
    put(at + 2, page.computed() ? page.base : bases[number]);
  }
  const struct {
    size_t field;
    const ByteVector& table;
  } tables[] = {
      {layout::kWeights, weights}, {layout::kExpansions, expansions}, {layout::kContractions, contractions}};
  for (const auto& [field, table] : tables) {
    put(field, payload.size());
    payload.insert(payload.end(), table.begin(), table.end());
  }
  return payload;
}

SortSource unpack_sort(const ByteVector& payload) {
  SortSource sort;
  sort.default_secondary = payload[layout::kDefaultSecondary];
  sort.default_tertiary = payload[layout::kDefaultTertiary];
  auto word = [&](size_t at) { return size_t{lx::le16(&payload[at])}; };
  std::map<char16_t, size_t> expansions;
  for (size_t i = 0; i < word(layout::kExpansionCount); ++i) {
    const size_t at = word(layout::kExpansions) + i * layout::kExpansionBytes;
    expansions.emplace(static_cast<char16_t>(word(at)), at);
  }
  for (size_t number = 0; number < sort.pages.size(); ++number) {
    const size_t at = layout::kPages + layout::kPageBytes * number;
    SortPage& page = sort.pages[number];
    const uint8_t flags = payload[at];
    page.kind = (flags & layout::kPageUncovered) != 0 ? SortPageKind::kUncovered
                : (flags & layout::kPagePrimary) != 0 ? SortPageKind::kPrimary
                : (flags & layout::kPageSpecial) != 0 ? SortPageKind::kSpecial
                                                      : SortPageKind::kTable;
    if (page.computed()) {
      page.base = static_cast<uint16_t>(word(at + 2));
      page.char_class = payload[at + 1] & kAppendAll;
    }
    if (page.kind != SortPageKind::kTable) continue;
    for (size_t low = 0; low < 256; ++low) {
      const auto character = static_cast<char16_t>(number << 8 | low);
      const size_t record = word(layout::kWeights) + (word(at + 2) + low) * layout::kWeightBytes;
      SortElement element = element_at(payload, record);
      if ((word(record + 4) & layout::kWeightExpansion) != 0) {
        const size_t expansion = expansions.at(character);
        element.count = 2;
        element.sets = {set_at(payload, expansion + 2), set_at(payload, expansion + 6)};
      }
      if (!element.ignored()) sort.characters.emplace(character, element);
    }
  }
  for (size_t i = 0; i < word(layout::kContractionCount); ++i) {
    const size_t at = word(layout::kContractions) + i * layout::kContractionBytes;
    sort.contractions.emplace(
        std::make_pair(static_cast<char16_t>(word(at)), static_cast<char16_t>(word(at + 2))),
        element_at(payload, at + 4));
  }
  return sort;
}

}  // namespace lexicor_data
