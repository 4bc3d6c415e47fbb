// Sort objects: validation and derivation when one is loaded, and the weights of characters and pairs.
#include "collate/lxsort.h"

#include <cstring>

#include "core/lxmemory.h"

using namespace lx;

namespace {

namespace fmt = format::sort;

constexpr size_t kPages = 256;
constexpr size_t kPageElements = 256;
constexpr unsigned kAppendsAll =
    LX_APPEND_PRIMARY | LX_APPEND_SECONDARY | LX_APPEND_TERTIARY | LX_APPEND_SPECIAL;

fmt::Page page_at(const uint8_t* payload, size_t page) {
  return fmt::Page::read(payload + fmt::kPages + fmt::Page::kBytes * page);
}
/// The weight records of a table page, by low byte.
const uint8_t* table_records(const uint8_t* payload, const fmt::Page& page) {
  return payload + le16(payload + fmt::kWeights) + fmt::WeightRecord::kBytes * page.base;
}
fmt::WeightRecord record_at(const uint8_t* records, size_t low) {
  return fmt::WeightRecord::read(records + fmt::WeightRecord::kBytes * low);
}
fmt::Expansion expansion_at(const uint8_t* payload, size_t i) {
  return fmt::Expansion::read(payload + le16(payload + fmt::kExpansions) + fmt::Expansion::kBytes * i);
}
fmt::Contraction contraction_at(const uint8_t* payload, size_t i) {
  return fmt::Contraction::read(payload + le16(payload + fmt::kContractions) + fmt::Contraction::kBytes * i);
}

Element element_of(const fmt::WeightRecord& record) {
  const LXWeights weights = record.is_special()
                                ? LXWeights{0, 0, 0, record.weight}
                                : LXWeights{record.weight, record.secondary, record.tertiary, 0};
  return Element(weights, 1, record.char_class());
}

/// An expansion has no weights until its record is found.
Element table_element(const fmt::WeightRecord& record) {
  return record.is_expansion() ? Element() : element_of(record);
}

/// Notes what an element of one set inserts. Only weights that it has count.
void note_set(Sort* sort, const Element& set) {
  const auto inserts = [&](uint32_t weight, unsigned bit) { return weight != 0 && !set.appends(bit); };
  if (inserts(set.primary(), LX_APPEND_PRIMARY)) sort->appends_primaries = false;
  if (inserts(set.primary(), LX_APPEND_PRIMARY) || inserts(set.secondary(), LX_APPEND_SECONDARY) ||
      inserts(set.tertiary(), LX_APPEND_TERTIARY) || inserts(set.special(), LX_APPEND_SPECIAL))
    sort->appends_all = false;
}
void note_insertion(Sort* sort, const Element& element) {
  if (element.char_class() == kAppendsAll) return;
  if (element.sets() != 2) return note_set(sort, element);
  note_set(sort, sort->first_set(element));
  note_set(sort, sort->second_set(element));
}

/// The pages that are laid flat: those of the weight table, and those where a pair begins or ends.
size_t flat_pages(const uint8_t* payload, bool (&flat)[kPages]) {
  for (size_t page = 0; page < kPages; ++page) flat[page] = page_at(payload, page).is_table();
  const size_t count = le16(payload + fmt::kContractionCount);
  for (size_t i = 0; i < count; ++i) {
    const fmt::Contraction pair = contraction_at(payload, i);
    flat[pair.first >> 8] = flat[pair.second >> 8] = true;
  }
  size_t pages = 0;
  for (bool is_flat : flat) pages += is_flat;
  return pages;
}

Element& flat_element(const Sort& sort, LXUChar u) {
  return const_cast<Element&>(sort.pages[u >> 8].elements[u & 0xFF]);
}

void fill_pages(Sort* sort, Element* elements, const bool (&flat)[kPages]) {
  const uint8_t* payload = sort->payload;
  for (size_t number = 0; number < kPages; ++number) {
    const fmt::Page record = page_at(payload, number);
    Sort::Page& page = sort->pages[number];
    page = {nullptr, record.flags, record.char_class, record.base};
    const bool computed = !record.is_table();
    // Of a whole page some character has a weight, whatever its base.
    if (computed) note_insertion(sort, Sort::computed(page, 0));
    if (computed) note_insertion(sort, Sort::computed(page, 1));
    if (!flat[number]) continue;
    const uint8_t* const records = computed ? nullptr : table_records(payload, record);
    for (size_t low = 0; low < kPageElements; ++low) {
      const auto u = static_cast<LXUChar>(number << 8 | low);
      elements[low] = computed ? Sort::computed(page, u) : table_element(record_at(records, low));
      note_insertion(sort, elements[low]);
    }
    page.elements = elements;
    elements += kPageElements;
  }
}

void fill_expansions(Sort* sort) {
  const uint8_t* payload = sort->payload;
  // From the back: of several records of a character the first counts.
  for (size_t i = le16(payload + fmt::kExpansionCount); i-- > 0;) {
    const LXUChar u = expansion_at(payload, i).character;
    const fmt::Page page = page_at(payload, u >> 8);
    if (!page.is_table()) continue;
    const fmt::WeightRecord pointing = record_at(table_records(payload, page), u & 0xFFu);
    if (!pointing.is_expansion()) continue;
    const Element element({0, 0, 0, static_cast<uint16_t>(i)}, 2, pointing.char_class());
    flat_element(*sort, u) = element;
    note_insertion(sort, element);
  }
}

/// The place of a pair among those in order, or where it belongs.
size_t place_of(const Pair* pairs, size_t count, uint32_t characters) {
  return lower_bound(count, [&](size_t i) { return pairs[i].characters < characters; });
}

void fill_pairs(Sort* sort, Pair* pairs) {
  const size_t count = le16(sort->payload + fmt::kContractionCount);
  sort->pairs = pairs;
  for (size_t i = 0; i < count; ++i) {
    const fmt::Contraction record = contraction_at(sort->payload, i);
    const uint32_t characters = static_cast<uint32_t>(record.first) << 16 | record.second;
    const size_t place = place_of(pairs, sort->pair_count, characters);
    if (place < sort->pair_count && pairs[place].characters == characters) continue;  // the first counts
    memmove(pairs + place + 1, pairs + place, (sort->pair_count - place) * sizeof(Pair));
    pairs[place] = {characters, element_of(record.weights)};
    ++sort->pair_count;
    note_insertion(sort, pairs[place].element);
    flat_element(*sort, record.first).set_starts_pair();
    flat_element(*sort, record.second).set_ends_pair();
    sort->second_bits[(record.second & 0xFF) / 32] |= 1u << record.second % 32;
  }
}

void note_alone(Sort* sort) {
  for (size_t page = 0; page < kPages; ++page) {
    for (size_t low = 0; sort->pages[page].elements != nullptr && low < kPageElements; ++low) {
      const auto u = static_cast<LXUChar>(page << 8 | low);
      Element& element = flat_element(*sort, u);
      element.note_own_primary();
      if (element.has_own_primary() && !element.starts_pair() && !element.ends_pair())
        element.set_stands_alone();
    }
  }
}

/// Where a public look-up stores a weight set.
struct SetOut {
  uint16_t* primary;
  uint8_t* secondary;
  uint8_t* tertiary;
  uint16_t* special;

  void store(const LXWeights& weights) const {
    *primary = weights.primary;
    *secondary = weights.secondary;
    *tertiary = weights.tertiary;
    *special = weights.special;
  }
};

/// Gives what a public look-up found to its caller; of an element without weights nothing is stored.
int32_t give(const Sort& sort, const Element& element, const SetOut& first, const SetOut& second,
             uint8_t* char_class) {
  if (element.sets() == 0) return 0;
  LXWeights weights[2];
  const int32_t sets = weight_sets(sort, element, &weights[0], &weights[1]);
  first.store(weights[0]);
  if (sets == 2) second.store(weights[1]);
  *char_class = static_cast<uint8_t>(element.char_class());
  return sets;
}

Fault validate_sort(uint16_t, const Sections& sections) {
  const Bytes bytes = sections.section[0];
  if (!bytes.holds(0, fmt::kFixedBytes)) return corrupt("the payload is shorter than its fixed part", 0);
  const uint8_t* payload = bytes.data;
  const auto table_fits = [&](size_t offset_field, size_t count, size_t record_bytes) {
    return bytes.holds(le16(payload + offset_field), count * record_bytes);
  };
  if (!table_fits(fmt::kExpansions, le16(payload + fmt::kExpansionCount), fmt::Expansion::kBytes))
    return corrupt("the expansions lie outside the payload", fmt::kExpansions);
  if (!table_fits(fmt::kContractions, le16(payload + fmt::kContractionCount), fmt::Contraction::kBytes))
    return corrupt("the contractions lie outside the payload", fmt::kContractions);
  for (size_t number = 0; number < kPages; ++number) {
    const fmt::Page page = page_at(payload, number);
    if (page.is_table() && !table_fits(fmt::kWeights, page.base + kPageElements, fmt::WeightRecord::kBytes))
      return corrupt("the weights of a page lie outside the payload", fmt::kPages + fmt::Page::kBytes * number);
  }
  return {};
}

void* derive_sort(uint16_t, const Sections& sections) {
  const uint8_t* payload = sections.section[0].data;
  bool flat[kPages];
  const size_t pages = flat_pages(payload, flat);
  const size_t pairs = le16(payload + fmt::kContractionCount);
  auto* sort = static_cast<Sort*>(
      hook_allocate_zeroed(sizeof(Sort) + pairs * sizeof(Pair) + pages * kPageElements * sizeof(Element)));
  if (sort == nullptr) return nullptr;
  sort->payload = payload;
  sort->expansions = payload + le16(payload + fmt::kExpansions);
  sort->default_secondary = payload[fmt::kDefaultSecondary];
  sort->default_tertiary = payload[fmt::kDefaultTertiary];
  sort->appends_primaries = true;
  sort->appends_all = true;
  auto* const first_pair = reinterpret_cast<Pair*>(sort + 1);
  fill_pages(sort, reinterpret_cast<Element*>(first_pair + pairs), flat);
  fill_expansions(sort);
  fill_pairs(sort, first_pair);
  note_alone(sort);
  return sort;
}

}  // namespace

namespace lx {

const ObjectType kSortType{validate_sort, derive_sort, nullptr, nullptr};

bool Sort::find_pair(LXUChar first, LXUChar second, Element* element) const {
  const uint32_t characters = static_cast<uint32_t>(first) << 16 | second;
  const size_t place = place_of(pairs, pair_count, characters);
  if (place == pair_count || pairs[place].characters != characters) return false;
  *element = pairs[place].element;
  return true;
}

}  // namespace lx

extern "C" {

int32_t LXSortGetWeights(const LXObject* object, LXUChar unicode, uint16_t* primary1, uint8_t* secondary1,
                         uint8_t* tertiary1, uint16_t* special1, uint16_t* primary2, uint8_t* secondary2,
                         uint8_t* tertiary2, uint16_t* special2, uint8_t* char_class) {
  if (!initialized() || object == nullptr || object->derived == nullptr) return 0;
  const Sort& sort = sort_of(*object);
  return give(sort, sort.element(unicode), {primary1, secondary1, tertiary1, special1},
              {primary2, secondary2, tertiary2, special2}, char_class);
}

int32_t LXSortGetCombination(const LXObject* object, LXUChar first, LXUChar second, uint16_t* primary,
                             uint8_t* secondary, uint8_t* tertiary, uint16_t* special, uint8_t* char_class) {
  Element element;
  if (!initialized() || object == nullptr || object->derived == nullptr) return 0;
  const Sort& sort = sort_of(*object);
  if (!sort.pair(first, second, &element)) return 0;
  return give(sort, element, {primary, secondary, tertiary, special}, {}, char_class);
}

}  // extern "C"
