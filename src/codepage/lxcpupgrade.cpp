// Version-1 codepages: no Shift bytes, a fixed part that is four bytes shorter, and trie nodes without a byte
// range. They are rewritten as version 2 when they are loaded.
#include <string.h>

#include "codepage/lxcodepage.h"
#include "core/lxmemory.h"
#include "core/lxobjtypes.h"
#include "core/lxtrace.h"

namespace {

namespace fmt = lx::format::codepage;
namespace v1 = lx::format::codepage::v1;

RAS1_Unit unit = RAS1_UNIT("lxcpupgrade");

size_t aligned(size_t bytes) {
  const size_t unit_bytes = lx::globals.area->table_alignment;
  return (bytes + unit_bytes - 1) / unit_bytes * unit_bytes;
}

struct TableMove {
  size_t from;
  size_t to;
  size_t bytes;
};

constexpr TableMove kFixedMoves[] = {
    {0, 0, fmt::kPairCount + 2},  // substitution, line ends, width, pair count
    {v1::kLengths, fmt::kLengths, 256}, {v1::kUpper, fmt::kUpper, 256},  {v1::kLower, fmt::kLower, 256},
    {v1::kUnicode, fmt::kUnicode, 512}, {v1::kTypes, fmt::kTypes, 1024}, {v1::kPages, fmt::kPages, 2048},
    {v1::kFlags, fmt::kFlags, 2},
};

// The offsets into the payload; each stands four bytes before its version-2 place.
constexpr size_t kPayloadOffsets[] = {v1::kFullWidth, v1::kPairs, v1::kTypeTrie, v1::kTypeRecords};
constexpr size_t kOffsetMove = fmt::kFixedBytes - v1::kFixedBytes;

/// The new payload; a block of `*bytes` bytes, or null. False when an offset does not fit.
bool upgrade_payload(lx::Bytes old, bool single_byte, uint8_t** block, size_t* bytes) {
  const size_t fixed_bytes = single_byte ? fmt::kFixedBytes : aligned(fmt::kFixedBytes);
  *bytes = fixed_bytes + (single_byte ? 0 : old.size - v1::kFixedBytes);
  uint8_t* fresh = static_cast<uint8_t*>(lx::hook_allocate_zeroed(*bytes));
  *block = fresh;
  if (fresh == nullptr) return true;
  for (const TableMove& move : kFixedMoves) memcpy(fresh + move.to, old.data + move.from, move.bytes);
  if (single_byte) return true;
  memcpy(fresh + fixed_bytes, old.data + v1::kFixedBytes, old.size - v1::kFixedBytes);
  for (size_t place : kPayloadOffsets) {
    const size_t offset = lx::le16(old.data + place);
    const size_t moved = offset != 0 ? offset + (fixed_bytes - v1::kFixedBytes) : 0;
    if (moved > UINT16_MAX) return false;
    lx::put_le16(fresh + place + kOffsetMove, static_cast<uint16_t>(moved));
  }
  return true;
}

/// The new multibyte-to-Unicode section: every node gets the range of all bytes. The values offset of the old
/// payload tells how many nodes there are.
bool upgrade_trie(lx::Bytes old, size_t old_values, uint8_t** block, size_t* bytes, size_t* values) {
  if (old_values > old.size) return false;
  const size_t nodes = old_values / v1::kNodeBytes;
  *values = aligned(nodes * fmt::kNodeBytes);
  if (*values > UINT16_MAX) return false;
  const size_t value_bytes = old.size - old_values;
  *bytes = *values + value_bytes;
  uint8_t* fresh = static_cast<uint8_t*>(lx::hook_allocate_zeroed(*bytes));
  *block = fresh;
  if (fresh == nullptr) return true;
  for (size_t i = 0; i < nodes; ++i) {
    const uint8_t* from = old.data + i * v1::kNodeBytes;
    uint8_t* to = fresh + i * fmt::kNodeBytes;
    memcpy(to, from, 2);
    to[2] = 0x00;
    to[3] = 0xFF;
    memcpy(to + 4, from + 2, 2);
  }
  if (value_bytes != 0) memcpy(fresh + *values, old.data + old_values, value_bytes);
  return true;
}

}  // namespace

namespace lx {

int32_t upgrade_codepage(const Sections& version1, Sections* upgraded) {
  const Bytes old = version1.section[0];
  if (!old.holds(0, v1::kFixedBytes)) return LX_E_CORRUPT;
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
    if (!upgrade_trie(version1.section[1], le16(old.data + v1::kUnicodeValues), &block, &bytes, &values))
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
  lx::Events events(unit);
  *new_section = nullptr;
  void* const none = nullptr;
  if (!lx::initialized() || payload_bytes < 0 || section_bytes < 0) return events.exit(none);
  lx::Sections version1;
  version1.section[0] = {static_cast<const uint8_t*>(payload), static_cast<size_t>(payload_bytes)};
  version1.section[1] = {static_cast<const uint8_t*>(section), static_cast<size_t>(section_bytes)};
  lx::Sections upgraded;
  if (lx::upgrade_codepage(version1, &upgraded) != LX_OK) return events.exit(none);
  if (upgraded.section[1].data != version1.section[1].data)
    *new_section = const_cast<uint8_t*>(upgraded.section[1].data);
  return events.exit(static_cast<void*>(const_cast<uint8_t*>(upgraded.section[0].data)));
}
