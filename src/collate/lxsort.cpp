// Sort objects: validation and derivation when one is loaded, and the weights of characters and pairs.
#include "collate/lxsort.h"

#include "core/lxmemory.h"
#include "core/lxobjtypes.h"

namespace {

namespace fmt = lx::format::sort;
using lx::Bytes;
using lx::Element;
using lx::le16;
using lx::Sort;

constexpr size_t kPages = 256;
constexpr size_t kPageElements = 256;

const uint8_t* page_at(const uint8_t* payload, size_t page) {
  return payload + fmt::kPages + fmt::kPageBytes * page;
}
bool is_table(uint8_t flags) {
  return (flags & (fmt::kPageUncovered | fmt::kPagePrimary | fmt::kPageSpecial)) == 0;
}

/// A weight of a table or contraction record.
Element element_of(const uint8_t* record) {
  const uint16_t flags = le16(record + 4);
  Element element{};
  element.sets = 1;
  element.char_class = (flags & fmt::kWeightClass) >> fmt::kWeightClassShift & 0xF;
  if ((flags & fmt::kWeightSpecial) != 0)
    element.weights.special = le16(record);
  else
    element.weights = {le16(record), record[2], record[3], 0};
  return element;
}

const uint8_t* table_record(const uint8_t* payload, LXUChar u) {
  const size_t base = le16(page_at(payload, u >> 8) + 2);
  return payload + le16(payload + fmt::kWeights) + fmt::kWeightBytes * (base + (u & 0xFFu));
}
bool is_expansion(const uint8_t* record) {
  return (le16(record + 4) & fmt::kWeightExpansion) != 0;
}

/// An expansion has no weights until its record is found.
Element table_element(const uint8_t* payload, LXUChar u) {
  const uint8_t* record = table_record(payload, u);
  return is_expansion(record) ? Element{} : element_of(record);
}

bool inserts_primary(const Element& element) {
  return element.sets != 0 && (element.char_class & LX_APPEND_PRIMARY) == 0;
}

/// The pages that are laid flat: those of the weight table, and those where a pair begins.
size_t flat_pages(const uint8_t* payload, bool (&flat)[kPages]) {
  for (size_t page = 0; page < kPages; ++page) flat[page] = is_table(page_at(payload, page)[0]);
  const uint8_t* record = payload + le16(payload + fmt::kContractions);
  const size_t count = le16(payload + fmt::kContractionCount);
  for (size_t i = 0; i < count; ++i, record += fmt::kContractionBytes) flat[le16(record) >> 8] = true;
  size_t pages = 0;
  for (bool is_flat : flat) pages += is_flat;
  return pages;
}

Element& flat_element(const Sort& sort, LXUChar u) {
  return const_cast<Element&>(sort.pages[u >> 8].elements[u & 0xFF]);
}

void fill(Sort* sort, Element* elements, const bool (&flat)[kPages]) {
  const uint8_t* payload = sort->payload;
  sort->appends_primaries = true;
  for (size_t number = 0; number < kPages; ++number) {
    const uint8_t* entry = page_at(payload, number);
    Sort::Page& page = sort->pages[number];
    page = {nullptr, entry[0], entry[1], le16(entry + 2)};
    const bool computed = !is_table(page.flags);
    if (computed && inserts_primary(Sort::computed(page, 0))) sort->appends_primaries = false;
    if (!flat[number]) continue;
    for (size_t low = 0; low < kPageElements; ++low) {
      const auto u = static_cast<LXUChar>(number << 8 | low);
      elements[low] = computed ? Sort::computed(page, u) : table_element(payload, u);
      if (inserts_primary(elements[low])) sort->appends_primaries = false;
    }
    page.elements = elements;
    elements += kPageElements;
  }
  // From the back: of several records of a character the first counts.
  for (size_t i = le16(payload + fmt::kExpansionCount); i-- > 0;) {
    const LXUChar u = le16(sort->expansions + fmt::kExpansionBytes * i);
    if (!is_table(sort->pages[u >> 8].flags) || !is_expansion(table_record(payload, u))) continue;
    Element& element = flat_element(*sort, u);
    element = element_of(table_record(payload, u));
    element.sets = 2;
    element.weights.special = static_cast<uint16_t>(i);
    if (inserts_primary(element)) sort->appends_primaries = false;
  }
  const uint8_t* record = sort->contractions;
  for (size_t i = 0; i < sort->contraction_count; ++i, record += fmt::kContractionBytes) {
    flat_element(*sort, le16(record)).starts_pair = 1;
    if (inserts_primary(element_of(record + 4))) sort->appends_primaries = false;
  }
}

/// Gives what a public look-up found to its caller.
int32_t give(const Sort& sort, const Element& element, LXWeights* first, LXWeights* second,
             uint8_t* char_class) {
  if (element.sets == 0) return 0;
  *char_class = element.char_class;
  if (element.sets == 1)
    *first = element.weights;
  else
    sort.expand(element, first, second);
  return element.sets;
}

}  // namespace

namespace lx {

int32_t validate_sort(Bytes bytes) {
  if (!bytes.holds(0, fmt::kFixedBytes)) return LX_E_CORRUPT;
  const uint8_t* payload = bytes.data;
  const auto table_fits = [&](size_t offset_field, size_t count, size_t record_bytes) {
    return bytes.holds(le16(payload + offset_field), count * record_bytes);
  };
  if (!table_fits(fmt::kExpansions, le16(payload + fmt::kExpansionCount), fmt::kExpansionBytes) ||
      !table_fits(fmt::kContractions, le16(payload + fmt::kContractionCount), fmt::kContractionBytes))
    return LX_E_CORRUPT;
  for (size_t page = 0; page < kPages; ++page) {
    const uint8_t* entry = page_at(payload, page);
    if (is_table(entry[0]) && !table_fits(fmt::kWeights, le16(entry + 2) + kPageElements, fmt::kWeightBytes))
      return LX_E_CORRUPT;
  }
  return LX_OK;
}

void* derive_sort(Bytes bytes) {
  const uint8_t* payload = bytes.data;
  bool flat[kPages];
  const size_t pages = flat_pages(payload, flat);
  auto* sort = static_cast<Sort*>(hook_allocate(sizeof(Sort) + pages * kPageElements * sizeof(Element)));
  if (sort == nullptr) return nullptr;
  sort->payload = payload;
  sort->contractions = payload + le16(payload + fmt::kContractions);
  sort->expansions = payload + le16(payload + fmt::kExpansions);
  sort->contraction_count = le16(payload + fmt::kContractionCount);
  sort->default_secondary = payload[fmt::kDefaultSecondary];
  sort->default_tertiary = payload[fmt::kDefaultTertiary];
  fill(sort, reinterpret_cast<Element*>(sort + 1), flat);
  return sort;
}

bool Sort::pair(LXUChar first, LXUChar second, Element* element) const {
  const uint8_t* record = contractions;
  for (size_t i = 0; i < contraction_count; ++i, record += fmt::kContractionBytes)
    if (le16(record) == first && le16(record + 2) == second) {
      *element = element_of(record + 4);
      return true;
    }
  return false;
}

}  // namespace lx

extern "C" {

int32_t LXSortGetWeights(const LXObject* object, LXUChar unicode, LXWeights* first, LXWeights* second,
                         uint8_t* char_class) {
  if (!lx::initialized() || object == nullptr || object->derived == nullptr) return 0;
  const Sort& sort = lx::sort_of(*object);
  return give(sort, sort.element(unicode), first, second, char_class);
}

int32_t LXSortGetCombination(const LXObject* object, LXUChar first, LXUChar second, LXWeights* weights,
                             uint8_t* char_class) {
  Element element;
  if (!lx::initialized() || object == nullptr || object->derived == nullptr) return 0;
  const Sort& sort = lx::sort_of(*object);
  if (!sort.pair(first, second, &element)) return 0;
  return give(sort, element, weights, nullptr, char_class);
}

}  // extern "C"
