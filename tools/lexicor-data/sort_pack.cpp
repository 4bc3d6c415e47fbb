// The layout of a sort's payload: fixed part, weight records, expansions, contractions, in this order. Tables
// are in ascending order of their characters.
#include "sort_pack.h"

#include <algorithm>
#include <tuple>
#include <vector>

#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "row_packer.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

namespace layout = lx::format::sort;

/// A weight record that rows can be ordered by.
struct Record : layout::WeightRecord {
  auto key() const { return std::tie(flags, tertiary, secondary, weight); }
  bool operator==(const Record& other) const { return key() == other.key(); }
  bool operator!=(const Record& other) const { return key() != other.key(); }
  bool operator<(const Record& other) const { return key() < other.key(); }
};

uint16_t flags_of(const SortElement& element) {
  unsigned flags = static_cast<unsigned>(element.char_class) << layout::WeightRecord::kClassShift;
  if (element.count == 2) flags |= layout::WeightRecord::kExpansion;
  if (element.count == 1 && element.sets[0].special != 0) flags |= layout::WeightRecord::kSpecial;
  return static_cast<uint16_t>(flags);
}

Record record_of(const SortElement& element) {
  if (element.ignored()) return {};
  const SortSet set = element.count == 2 ? SortSet{} : element.sets[0];
  const uint16_t weight = set.special != 0 ? set.special : set.primary;
  return {{weight, set.secondary, set.tertiary, flags_of(element)}};
}

/// The weights of a table page's character, or of a contraction.
SortElement element_of(const layout::WeightRecord& record) {
  SortElement element;
  element.char_class = record.char_class();
  if (record.is_special()) {
    element.sets[0].special = record.weight;
  } else {
    element.sets[0] = {record.weight, record.secondary, record.tertiary, 0};
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
  Packer packer(Record{});
  const std::vector<size_t> positions = packer.place(requests);
  for (size_t i = 0; i < numbers.size(); ++i) bases[numbers[i]] = static_cast<uint16_t>(positions[i]);
  return packer.pool();
}

constexpr uint8_t kPageFlags[] = {layout::kPageUncovered, 0, layout::kPagePrimary, layout::kPageSpecial};

}  // namespace

ByteVector pack_sort(const SortSource& sort, const std::string& file_name) {
  std::array<uint16_t, 256> bases{};
  ByteVector weights, expansions, contractions;
  for (Record record : pack_rows(sort, bases)) append_record<layout::WeightRecord>(weights, record);
  for (const auto& [character, element] : sort.characters) {
    if (element.count != 2) continue;
    layout::Expansion record{character};
    for (size_t i = 0; i < element.sets.size(); ++i) {
      const SortSet& set = element.sets[i];
      record.sets[i] = {set.primary, set.secondary, set.tertiary};
    }
    append_record(expansions, record);
  }
  for (const auto& [pair, element] : sort.contractions) {
    layout::Contraction record{pair.first, pair.second, record_of(element)};
    record.weights.flags = flags_of(element);
    append_record(contractions, record);
  }

  const size_t bytes = layout::kFixedBytes + weights.size() + expansions.size() + contractions.size();
  if (bytes > lx::format::kMaxSectionBytes) {
    throw SourceError(file_name, sort.size_place.line, sort.size_place.column,
                      "the payload takes " + std::to_string(bytes) + " bytes, more than 65535: weights " +
                          std::to_string(weights.size()) + ", expansions " + std::to_string(expansions.size()) +
                          ", contractions " + std::to_string(contractions.size()));
  }
  ByteVector payload(layout::kFixedBytes);
  payload[layout::kDefaultSecondary] = sort.default_secondary;
  payload[layout::kDefaultTertiary] = sort.default_tertiary;
  auto put = [&](size_t at, size_t value) { lx::put_le16(&payload[at], static_cast<uint16_t>(value)); };
  put(layout::kExpansionCount, expansions.size() / layout::Expansion::kBytes);
  put(layout::kContractionCount, contractions.size() / layout::Contraction::kBytes);
  for (size_t number = 0; number < sort.pages.size(); ++number) {
    const SortPage& page = sort.pages[number];
    layout::Page record{kPageFlags[static_cast<size_t>(page.kind)], 0, bases[number]};
    if (page.computed()) record = {record.flags, page.char_class, page.base};
    record.write(&payload[layout::kPages + layout::Page::kBytes * number]);
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
  std::map<char16_t, layout::Expansion> expansions;
  for (size_t i = 0; i < word(layout::kExpansionCount); ++i) {
    const size_t at = word(layout::kExpansions) + i * layout::Expansion::kBytes;
    const auto record = record_at<layout::Expansion>(payload, at);
    expansions.emplace(static_cast<char16_t>(record.character), record);
  }
  for (size_t number = 0; number < sort.pages.size(); ++number) {
    const auto entry = record_at<layout::Page>(payload, layout::kPages + layout::Page::kBytes * number);
    SortPage& page = sort.pages[number];
    page.kind = (entry.flags & layout::kPageUncovered) != 0 ? SortPageKind::kUncovered
                : (entry.flags & layout::kPagePrimary) != 0 ? SortPageKind::kPrimary
                : (entry.flags & layout::kPageSpecial) != 0 ? SortPageKind::kSpecial
                                                            : SortPageKind::kTable;
    if (page.computed()) {
      page.base = entry.base;
      page.char_class = entry.char_class & kAppendAll;
    }
    if (page.kind != SortPageKind::kTable) continue;
    for (size_t low = 0; low < 256; ++low) {
      const auto character = static_cast<char16_t>(number << 8 | low);
      const auto record = record_at<layout::WeightRecord>(
          payload, word(layout::kWeights) + (entry.base + low) * layout::WeightRecord::kBytes);
      SortElement element = element_of(record);
      if (record.is_expansion()) {
        element.count = 2;
        for (size_t i = 0; i < element.sets.size(); ++i) {
          const layout::Expansion::Set& set = expansions.at(character).sets[i];
          element.sets[i] = {set.primary, set.secondary, set.tertiary, 0};
        }
      }
      if (!element.ignored()) sort.characters.emplace(character, element);
    }
  }
  for (size_t i = 0; i < word(layout::kContractionCount); ++i) {
    const auto record =
        record_at<layout::Contraction>(payload, word(layout::kContractions) + i * layout::Contraction::kBytes);
    sort.contractions.emplace(std::make_pair(record.first, record.second), element_of(record.weights));
  }
  return sort;
}

}  // namespace lexicor_data
