// Lays out the sections of a codepage object and chooses what to leave out when they are too small.
#include "codepage_pack.h"

#include <algorithm>
#include <map>
#include <unordered_set>

#include "codepage/lxunicode.h"
#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "row_packer.h"
#include "trie_builder.h"

namespace lexicor_data {
namespace {

namespace cp = lx::format::codepage;

enum class TwoByteKind { kWords, kByteArrays };

// -- Unicode pages ------------------------------------------------------------------------------------------

struct Pages {
  std::array<cp::PageEntry, 256> pages;
  ByteVector low, high;
};

/// The page's kind by its longest character.
uint8_t kind_of_page(const uint32_t* codes, TwoByteKind two_byte) {
  uint8_t longest = 1;
  for (int i = 0; i < 256; ++i) {
    if (codes[i] != kNoCode) longest = std::max(longest, code_bytes(codes[i]));
  }
  switch (longest) {
    case 1:
      return cp::kKindByte;
    case 2:
      return two_byte == TwoByteKind::kWords ? cp::kKindWord : cp::kKindByteByte;
    case 3:
      return cp::kKindByteWord;
    default:
      return cp::kKindWordWord;
  }
}

/// Rows of 16-bit words and rows of bytes in one section: the words first, at even offsets.
class MixedArray {
 public:
  void add(uint16_t& offset, bool words, std::vector<uint32_t> row, size_t first_index) {
    entries_.push_back({&offset, words, std::move(row), first_index});
  }

  ByteVector pack() {
    RowPacker<uint16_t> words(0);
    place(words, true);
    ByteVector bytes;
    for (uint16_t word : words.pool()) append_le16(bytes, word);
    RowPacker<uint8_t> packer(0, std::move(bytes));
    place(packer, false);
    return packer.pool();
  }

 private:
  struct Entry {
    uint16_t* offset;
    bool words;
    std::vector<uint32_t> row;
    size_t first_index;
  };

  template <typename Element>
  void place(RowPacker<Element>& packer, bool words) {
    std::vector<typename RowPacker<Element>::Request> requests;
    std::vector<uint16_t*> offsets;
    for (const Entry& entry : entries_) {
      if (entry.words != words) continue;
      typename RowPacker<Element>::Request request;
      for (uint32_t value : entry.row) request.row.push_back(static_cast<Element>(value));
      request.first_index = entry.first_index;
      requests.push_back(std::move(request));
      offsets.push_back(entry.offset);
    }
    const auto positions = packer.place(requests);
    for (size_t i = 0; i < offsets.size(); ++i) {
      *offsets[i] = static_cast<uint16_t>(positions[i] - requests[i].first_index);
    }
  }

  std::vector<Entry> entries_;
};

Pages build_pages(const CodepageModel& model, TwoByteKind two_byte) {
  Pages result;
  if (model.header.utf8) return result;
  MixedArray low, high;
  for (size_t number = 0; number < 256; ++number) {
    const uint32_t* codes = &model.from_unicode[number << 8];
    int lowest = 0, highest = 255;
    while (lowest < 256 && codes[lowest] == kNoCode) ++lowest;
    if (lowest == 256) continue;
    while (codes[highest] == kNoCode) --highest;
    cp::PageEntry& page = result.pages[number];
    page.kind = kind_of_page(codes, two_byte);
    page.lowest = static_cast<uint8_t>(lowest);
    page.highest = static_cast<uint8_t>(highest);
    page.mask = mask_for_range(page.lowest, page.highest);

    const size_t low_bits = 8 * page.low_bytes();
    std::vector<uint32_t> low_row, high_row;
    for (int i = lowest; i <= highest; ++i) {
      const uint32_t code = codes[i] == kNoCode ? model.substitution() : codes[i];
      low_row.push_back(code & ((1U << low_bits) - 1));
      high_row.push_back(code >> low_bits);
    }
    const size_t first_index = page.lowest & page.mask;
    low.add(page.low, page.low_bytes() == 2, std::move(low_row), first_index);
    if (page.high_bytes() != 0) high.add(page.high, page.high_bytes() == 2, std::move(high_row), first_index);
  }
  result.low = low.pack();
  result.high = high.pack();
  return result;
}

// -- payload ------------------------------------------------------------------------------------------------

void align4(ByteVector& out) {
  while (out.size() % 4 != 0) out.push_back(0);
}

/// The one-byte round-trip code of another case of the byte's value, or the byte itself.
uint8_t other_case(const CodepageModel& model, uint8_t byte, uint16_t other) {
  if (model.value_of(byte) == kNoValue || other == model.value_of(byte)) return byte;
  const uint32_t code = model.round_trip(other);
  return code <= 0xFF ? static_cast<uint8_t>(code) : byte;
}

ByteVector fixed_part(const CodepageModel& model, const Pages& pages) {
  const CodepageSource& header = model.header;
  ByteVector out(cp::kFixedBytes);
  out[cp::kSubstitution] = header.substitution;
  std::copy(header.line_ends.begin(), header.line_ends.end(), out.begin() + cp::kLineEnds);
  out[cp::kWidth] = header.width;
  if (model.is_shift()) {
    out[cp::kShiftOut] = kShiftOut;
    out[cp::kShiftIn] = kShiftIn;
  }
  for (unsigned byte = 0; byte < 256; ++byte) {
    const uint16_t unicode = model.value_of(byte);
    out[cp::kLengths + byte] = header.leads[byte];
    out[cp::kUpper + byte] = other_case(model, static_cast<uint8_t>(byte), lx::unicode_upper(unicode));
    out[cp::kLower + byte] = other_case(model, static_cast<uint8_t>(byte), lx::unicode_lower(unicode));
    lx::put_le16(&out[cp::kUnicode + 2 * byte], unicode);
    lx::put_le32(&out[cp::kTypes + 4 * byte], unicode == kNoValue ? 0 : lx::unicode_type(unicode));
    pages.pages[byte].write(&out[cp::kPages + cp::PageEntry::kBytes * byte]);
  }
  lx::put_le16(&out[cp::kFlags], static_cast<uint16_t>((header.ascii ? cp::kFlagAscii : 0) |
                                                       (model.is_shift() ? cp::kFlagShift : 0)));
  return out;
}

/// The code of the value's full-width form, when it is another value with a longer character; else 0.
uint32_t full_width_code(const CodepageModel& model, uint16_t unicode) {
  if (unicode == kNoValue) return 0;
  const uint16_t full = lx::unicode_half_to_full(unicode);
  const uint32_t code = full == unicode ? kNoCode : model.round_trip(full);
  return code == kNoCode || code <= 0xFF ? 0 : code;
}

/// Appends the full-width table, the width pairs and the type trie, and stores where they stand.
/// Returns the trie's count of retyped characters.
size_t append_variable_part(ByteVector& out, const CodepageModel& model, TypeRows rows) {
  auto begin_part = [&](size_t offset_field) {
    align4(out);
    lx::put_le16(&out[offset_field], static_cast<uint16_t>(out.size()));
  };
  begin_part(cp::kFullWidth);
  for (unsigned byte = 0; byte < 256; ++byte) append_le32(out, full_width_code(model, model.value_of(byte)));

  begin_part(cp::kPairs);
  uint16_t pair_count = 0;
  for (const auto [code, unicode] : model.to_unicode) {
    if (code <= 0xFF || model.round_trip(unicode) != code) continue;
    const uint32_t full = full_width_code(model, unicode);
    if (full == 0) continue;
    append_record(out, cp::WidthPair{code, full});
    ++pair_count;
  }
  lx::put_le16(&out[cp::kPairCount], pair_count);

  const TypeTrie types = build_type_trie(model, rows);
  begin_part(cp::kTypeTrie);
  out.insert(out.end(), types.nodes.begin(), types.nodes.end());
  begin_part(cp::kTypeRecords);
  out.insert(out.end(), types.records.begin(), types.records.end());
  return types.retyped_chars;
}

// -- the whole object ---------------------------------------------------------------------------------------

struct Packing {
  std::vector<ByteVector> sections;
  size_t retyped_chars = 0;
  TypeRows type_rows = TypeRows::kExact;
};

constexpr size_t kPayload = 0, kTrie = 1, kLow = 2, kHigh = 3;

bool fits(const ByteVector& section) {
  return section.size() <= lx::format::kMaxSectionBytes;
}

/// From the tightest to the loosest, which takes the least room as a rule.
constexpr TypeRows kTypeRows[] = {TypeRows::kExact, TypeRows::kShared, TypeRows::kUniform, TypeRows::kLoose};

Pages pack_pages(const CodepageModel& model) {
  const Pages pages = build_pages(model, TwoByteKind::kWords);
  return fits(pages.low) ? pages : build_pages(model, TwoByteKind::kByteArrays);
}

/// The payload with the first of the type rows with which it fits, or else with the last.
void pack_payload(Packing& packing, const CodepageModel& model, const Pages& pages) {
  const ByteVector fixed = fixed_part(model, pages);
  packing.sections[kPayload] = fixed;
  if (!model.is_multibyte()) return;
  for (TypeRows rows : kTypeRows) {
    packing.sections[kPayload] = fixed;
    packing.retyped_chars = append_variable_part(packing.sections[kPayload], model, rows);
    packing.type_rows = rows;
    if (fits(packing.sections[kPayload])) return;
  }
}

/// Whether one section fits; the others are not looked at.
bool section_fits(const CodepageModel& model, size_t section) {
  if (section == kTrie) return fits(build_unicode_trie(model).section);
  if (section != kPayload) {
    const Pages pages = pack_pages(model);
    return fits(section == kLow ? pages.low : pages.high);
  }
  const ByteVector fixed = fixed_part(model, Pages());  // which has the same size whatever the pages are
  return std::any_of(std::rbegin(kTypeRows), std::rend(kTypeRows), [&](TypeRows rows) {
    ByteVector payload = fixed;
    append_variable_part(payload, model, rows);
    return fits(payload);
  });
}

Packing pack_sections(const CodepageModel& model) {
  const Pages pages = pack_pages(model);
  Packing packing;
  std::vector<ByteVector>& sections = packing.sections;
  sections.resize(lx::format::kMaxSections);
  sections[kLow] = pages.low;
  sections[kHigh] = pages.high;
  pack_payload(packing, model, pages);
  if (model.is_multibyte() && !model.header.utf8) {
    const UnicodeTrie trie = build_unicode_trie(model);
    sections[kTrie] = trie.section;
    lx::put_le16(&sections[kPayload][cp::kUnicodeValues], static_cast<uint16_t>(trie.values_offset));
  }
  while (sections.back().empty()) sections.pop_back();
  return packing;
}

/// The first section that is too large, or the number of sections.
size_t overflow(const CodepageModel& model) {
  const size_t sections = model.is_multibyte() && !model.header.utf8 ? lx::format::kMaxSections : 0;
  for (size_t section = 0; section < sections; ++section)
    if (!section_fits(model, section)) return section;
  return lx::format::kMaxSections;
}

// -- leaving characters out ---------------------------------------------------------------------------------

constexpr uint32_t kFirstPrivateUse = 0xE000, kLastPrivateUse = 0xF8FF;

/// What numbers the rows of a section: codes (a row is a trie leaf) or Unicode values (a row is a page). The
/// number of a character over 256 is that of its row.
enum class RowsBy { kCode, kUnicode };

uint32_t number_of(const Mapping& m, RowsBy by) {
  return by == RowsBy::kCode ? m.code : m.unicode;
}

/// The characters of a row, in order. A cut takes those at one end; it frees the cells up to the next
/// character.
class Row {
 public:
  void add(uint32_t number, bool private_use) {
    numbers_.push_back(number);
    private_use_ = private_use_ && private_use;
  }
  bool empty() const { return numbers_.empty(); }
  uint32_t first() const { return numbers_.front(); }
  bool private_use() const { return private_use_; }  ///< all its characters are

  /// Finds the cut that frees the most cells for each character.
  void find_cut() {
    cut_chars_ = cut_cells_ = 0;
    const size_t chars = numbers_.size();
    for (size_t count = 1; count <= chars; ++count) {
      const size_t head =
          count < chars ? numbers_[count] - numbers_.front() : numbers_.back() - numbers_.front() + 1;
      const size_t tail = count < chars ? numbers_.back() - numbers_[chars - count - 1] : head;
      consider(tail, count, false);
      consider(head, count, true);
    }
  }

  /// Whether this row's cut is the better one.
  bool cuts_better_than(const Row& other) const {
    return cut_cells_ * other.cut_chars_ > other.cut_cells_ * cut_chars_;
  }

  std::vector<uint32_t> cut() {
    const auto count = static_cast<std::ptrdiff_t>(cut_chars_);
    const auto begin = cut_head_ ? numbers_.begin() : numbers_.end() - count;
    const std::vector<uint32_t> taken(begin, begin + count);
    numbers_.erase(begin, begin + count);
    find_cut();
    return taken;
  }

 private:
  void consider(size_t cells, size_t chars, bool head) {
    if (cut_chars_ != 0 && cells * cut_chars_ <= cut_cells_ * chars) return;
    cut_cells_ = cells, cut_chars_ = chars, cut_head_ = head;
  }

  std::vector<uint32_t> numbers_;
  bool private_use_ = true;
  size_t cut_cells_ = 0, cut_chars_ = 0;
  bool cut_head_ = false;
};

/// All longer characters in the order in which they are dropped, cut by cut.
std::vector<std::vector<uint32_t>> cuts_in_order(const CodepageSource& source, RowsBy by) {
  std::map<uint32_t, bool> numbers;  // and whether the character is for private use
  for (const Mapping& m : source.mappings) {
    if (m.bytes == 1 || m.precision == (by == RowsBy::kCode ? 1 : 3)) continue;
    numbers[number_of(m, by)] = m.unicode >= kFirstPrivateUse && m.unicode <= kLastPrivateUse;
  }
  std::map<uint32_t, Row> by_number;
  for (const auto& [number, private_use] : numbers) by_number[number >> 8].add(number, private_use);
  std::vector<Row> rows;
  for (auto& [number, row] : by_number) {
    row.find_cut();
    rows.push_back(row);
  }
  auto worse = [](const Row& a, const Row& b) {
    if (a.private_use() != b.private_use()) return b.private_use();
    if (a.cuts_better_than(b) || b.cuts_better_than(a)) return b.cuts_better_than(a);
    return a.first() < b.first();
  };
  std::make_heap(rows.begin(), rows.end(), worse);
  std::vector<std::vector<uint32_t>> cuts;
  while (!rows.empty()) {
    std::pop_heap(rows.begin(), rows.end(), worse);
    cuts.push_back(rows.back().cut());
    if (rows.back().empty()) {
      rows.pop_back();
    } else {
      std::push_heap(rows.begin(), rows.end(), worse);
    }
  }
  return cuts;
}

/// The source without some characters, which go to `dropped`.
CodepageSource without(const CodepageSource& source, const std::unordered_set<uint32_t>& numbers, RowsBy by,
                       std::vector<Mapping>& dropped) {
  std::vector<bool> gone(source.mappings.size());
  std::unordered_set<uint32_t> codes, values;
  auto drop = [&](size_t i) {
    gone[i] = true;
    codes.insert(source.mappings[i].code);
    values.insert(source.mappings[i].unicode);
  };
  for (size_t i = 0; i < source.mappings.size(); ++i) {
    const Mapping& m = source.mappings[i];
    if (m.bytes > 1 && numbers.count(number_of(m, by)) != 0) drop(i);
  }
  // A mapping to or from a dropped character would be a one-way rest.
  for (bool changed = true; changed;) {
    changed = false;
    for (size_t i = 0; i < source.mappings.size(); ++i) {
      const Mapping& m = source.mappings[i];
      if (gone[i] || m.bytes == 1 || (codes.count(m.code) == 0 && values.count(m.unicode) == 0)) continue;
      drop(i);
      changed = true;
    }
  }
  CodepageSource rest = source;
  rest.mappings.clear();
  for (size_t i = 0; i < source.mappings.size(); ++i) {
    (gone[i] ? dropped : rest.mappings).push_back(source.mappings[i]);
  }
  return rest;
}

}  // namespace

PackedCodepage pack_codepage(CodepageModel model, const std::string& file_name,
                             std::vector<LeftOut>& left_out) {
  PackedCodepage result;
  for (size_t section = overflow(model); section < lx::format::kMaxSections; section = overflow(model)) {
    const RowsBy by = section == kPayload || section == kTrie ? RowsBy::kCode : RowsBy::kUnicode;
    const CodepageSource source = to_source(model);
    const auto cuts = cuts_in_order(source, by);
    // The smallest number of cuts with which the section fits.
    size_t too_few = 0, enough = cuts.size() + 1;
    std::vector<Mapping> dropped;
    while (enough - too_few > 1) {
      const size_t count = (too_few + enough) / 2;
      std::unordered_set<uint32_t> numbers;
      for (size_t i = 0; i < count; ++i) numbers.insert(cuts[i].begin(), cuts[i].end());
      std::vector<Mapping> dropped_now;
      std::vector<LeftOut> none;
      CodepageModel rest = to_model(without(source, numbers, by, dropped_now), file_name, none);
      if (!section_fits(rest, section)) {
        too_few = count;
        continue;
      }
      enough = count;
      model = std::move(rest);
      dropped = std::move(dropped_now);
    }
    if (enough > cuts.size()) throw SourceError(file_name, 0, 0, "the codepage does not fit its object");
    for (const Mapping& m : dropped) left_out.push_back({m, "no room"});
  }
  Packing packing = pack_sections(model);
  result.object.sections = std::move(packing.sections);
  result.retyped_chars = packing.retyped_chars;
  result.type_rows = packing.type_rows;
  result.model = std::move(model);
  return result;
}

}  // namespace lexicor_data
