// Version-1 codepages: no Shift bytes, a fixed part that is four bytes shorter, and trie nodes without a byte
// range. They are rewritten as version 2 when they are loaded.
#include <string.h>

#include "codepage/lxcodepage.h"
#include "core/lxmemory.h"
#include "core/lxtrace.h"

using namespace lx;

namespace {

namespace fmt = format::codepage;

RAS1_Unit unit = RAS1_UNIT("lxcpupgrade");

size_t aligned(size_t bytes) {
  const size_t unit_bytes = globals.area->table_alignment;
  return (bytes + unit_bytes - 1) / unit_bytes * unit_bytes;
}

constexpr size_t kFixedBytes1 = fmt::in_version1(fmt::kFixedBytes);

// What stands in one piece in both versions: up to the shift bytes, up to the types, and on to the offsets.
struct TableMove {
  size_t to;
  size_t end;
};
constexpr TableMove kFixedMoves[] = {
    {0, fmt::kShiftOut}, {fmt::kLengths, fmt::kUnicode + 2 * 256}, {fmt::kTypes, fmt::kFullWidth}};
constexpr size_t kPayloadOffsets[] = {fmt::kFullWidth, fmt::kPairs, fmt::kTypeTrie, fmt::kTypeRecords};

/// The new payload; a block of `*bytes` bytes, or null. False when an offset does not fit.
bool upgrade_payload(Bytes old, bool single_byte, uint8_t** block, size_t* bytes) {
  const size_t fixed_bytes = single_byte ? fmt::kFixedBytes : aligned(fmt::kFixedBytes);
  *bytes = fixed_bytes + (single_byte ? 0 : old.size - kFixedBytes1);
  uint8_t* fresh = static_cast<uint8_t*>(hook_allocate_zeroed(*bytes));
  *block = fresh;
  if (fresh == nullptr) return true;
  for (const TableMove& move : kFixedMoves)
    memcpy(fresh + move.to, old.data + fmt::in_version1(move.to), move.end - move.to);
  if (single_byte) return true;
  memcpy(fresh + fixed_bytes, old.data + kFixedBytes1, old.size - kFixedBytes1);
  for (size_t field : kPayloadOffsets) {
    const size_t offset = le16(old.data + fmt::in_version1(field));
    const size_t moved = offset != 0 ? offset + (fixed_bytes - kFixedBytes1) : 0;
    if (moved > UINT16_MAX) return false;
    put_le16(fresh + field, static_cast<uint16_t>(moved));
  }
  return true;
}

/// The new multibyte-to-Unicode section: every node gets the range of all bytes. The values offset of the old
/// payload tells how many nodes there are.
bool upgrade_trie(Bytes old, size_t old_values, uint8_t** block, size_t* bytes, size_t* values) {
  if (old_values > old.size) return false;
  const size_t nodes = old_values / fmt::TypeNode::kBytes;
  *values = aligned(nodes * fmt::UnicodeNode::kBytes);
  if (*values > UINT16_MAX) return false;
  const size_t value_bytes = old.size - old_values;
  *bytes = *values + value_bytes;
  uint8_t* fresh = static_cast<uint8_t*>(hook_allocate_zeroed(*bytes));
  *block = fresh;
  if (fresh == nullptr) return true;
  for (size_t i = 0; i < nodes; ++i) {
    const auto node = fmt::TypeNode::read(old.data + i * fmt::TypeNode::kBytes);
    const fmt::UnicodeNode ranged{node.leaf, node.mask, node.lowest, node.highest, node.base};
    ranged.write(fresh + i * fmt::UnicodeNode::kBytes);
  }
  if (value_bytes != 0) memcpy(fresh + *values, old.data + old_values, value_bytes);
  return true;
}

}  // namespace

namespace lx {

int32_t upgrade_codepage(const Sections& version1, Sections* upgraded) {
  const Bytes old = version1.section[0];
  if (!old.holds(0, kFixedBytes1)) return LX_E_CORRUPT;
  const bool single_byte = old.data[fmt::kWidth] < 2;
  *upgraded = version1;

  uint8_t* block = nullptr;
  size_t bytes = 0;
  const bool offsets_fit = upgrade_payload(old, single_byte, &block, &bytes);
  HookPtr<uint8_t> payload(block);
  if (!offsets_fit) return LX_E_CORRUPT;
  if (!payload) return LX_E_MEMORY;
  upgraded->section[0] = {payload.get(), bytes};
  if (!single_byte) {
    size_t values = 0;
    if (!upgrade_trie(version1.section[1], le16(old.data + fmt::in_version1(fmt::kUnicodeValues)), &block,
                      &bytes, &values))
      return LX_E_CORRUPT;
    if (block == nullptr) return LX_E_MEMORY;
    put_le16(payload.get() + fmt::kUnicodeValues, static_cast<uint16_t>(values));
    upgraded->section[1] = {block, bytes};
  }
  payload.detach();
  return LX_OK;
}

}  // namespace lx

extern "C" void* LXCpV1toV2(const void* payload, int32_t payload_bytes, const void* section,
                            int32_t section_bytes, void** new_section) {
  Events events(unit);
  *new_section = nullptr;
  void* const none = nullptr;
  if (!initialized() || payload_bytes < 0 || section_bytes < 0) return events.exit(none);
  Sections version1;
  version1.section[0] = {static_cast<const uint8_t*>(payload), static_cast<size_t>(payload_bytes)};
  version1.section[1] = {static_cast<const uint8_t*>(section), static_cast<size_t>(section_bytes)};
  Sections upgraded;
  if (upgrade_codepage(version1, &upgraded) != LX_OK) return events.exit(none);
  if (upgraded.section[1].data != version1.section[1].data)
    *new_section = const_cast<uint8_t*>(upgraded.section[1].data);
  return events.exit(static_cast<void*>(const_cast<uint8_t*>(upgraded.section[0].data)));
}
