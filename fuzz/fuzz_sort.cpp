// Any bytes as the file of a sort: refused, or comparison and keys are safe with every character and pair of neighbours,
// and a key has the length that it says.
#include "files.h"

namespace lx::fuzz::sort {
namespace {

constexpr int32_t kUnits = 0x10000;

void use_weights(const LXObject* sort) {
  for (uint32_t u = 0; u < kUnits; u += 3) {
    const auto first = static_cast<LXUChar>(u);
    LXWeights a{}, b{};
    uint8_t char_class = 0;
    const int32_t sets = LXSortGetWeights(sort, first, &a.primary, &a.secondary, &a.tertiary, &a.special,
                                          &b.primary, &b.secondary, &b.tertiary, &b.special, &char_class);
    must(sets >= 0 && sets <= 2 && char_class <= 15, "a character has up to two sets");
    LXSortGetCombination(sort, first, static_cast<LXUChar>(u + 1), &a.primary, &a.secondary, &a.tertiary,
                         &a.special, &char_class);
  }
}

}  // namespace

FUZZ_TARGET(sort) {
  const FileLibrary library("so_00001.nls", in);
  LXLocale* const l = library.locale();
  int32_t rc = LX_OK;
  const LXObject* const sort = LXGetObjFromID(nullptr, LX_SORT, 1, LX_FIND_AND_LOAD, &rc);
  if (l == nullptr || sort == nullptr) return;
  use_weights(sort);
  static LXUChar all[kUnits];
  for (int32_t u = 0; u < kUnits; ++u) all[u] = static_cast<LXUChar>(u);
  for (const uint32_t options : {0u, LX_CASE_INSENSITIVE})
    for (int32_t at = 0; at + 40 < kUnits; at += 64) {
      LXStrcollU(l, all + at, 24, all + at + 16, 24, options);
      LXStrcollU(l, all + at, 24, all + at, 20, options);
      fitted<uint8_t>(
          [&](uint8_t* to, int32_t size) {
            const int32_t bytes = LXStrxfrmU(l, to, size, all + at, 9, options);
            return bytes <= size ? bytes : 0;
          },
          200);
    }
}

}  // namespace lx::fuzz::sort
