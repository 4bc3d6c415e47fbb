// The weights of a text, level by level, as keys and the full comparison need them.
#pragma once

#include "codepage/lxtext.h"
#include "collate/lxsort.h"
#include "core/lxmemory.h"

namespace lx {

/// One level that grows: weights are appended, or inserted ahead of the run of inserted weights before them, so
/// that a run ends up in reverse order. A run is turned round when it ends.
template <class Weight>
struct Level {
  Weight* begin;
  Weight* run;
  Weight* end;

  explicit Level(void* space) : begin(static_cast<Weight*>(space)), run(begin), end(begin) {}

  size_t count() const { return static_cast<size_t>(end - begin); }
  void add(Weight weight, bool append) {
    if (append) close_run();
    *end++ = weight;
    if (append) run = end;
  }
  void close_run() {
    for (Weight *low = run, *high = end; high - low > 1;) {
      const Weight kept = *low;
      *low++ = *--high;
      *high = kept;
    }
    run = end;
  }
};

struct PlacedSpecial {
  uint16_t position;
  uint16_t weight;
};

/// The four levels of a text of at most `most_chars` characters, in a space of bytes_for(most_chars) bytes that
/// is aligned to 4 bytes. The levels stand in the order of a key, a byte between two of them, so that one can
/// be made of them in place.
struct Levels {
  Level<uint16_t> primaries;
  Level<uint8_t> secondaries;
  Level<uint8_t> tertiaries;
  Level<PlacedSpecial> specials;
  size_t chars;  // of the text

  // A character has up to two weight sets, or one special weight.
  static constexpr size_t kPrimaryBytes = 2 * sizeof(uint16_t);
  static constexpr size_t kByteLevelBytes = 2;
  static constexpr size_t kLevelBytes = kPrimaryBytes + 2 * kByteLevelBytes;
  static constexpr size_t kSeparators = 3;

  static constexpr size_t specials_at(size_t chars) {
    return (chars * kLevelBytes + kSeparators + 3) & ~size_t{3};
  }
  static constexpr size_t bytes_for(size_t chars) { return specials_at(chars) + chars * sizeof(PlacedSpecial); }
  static constexpr size_t kMostChars = INT32_MAX / (2 * (kLevelBytes + sizeof(PlacedSpecial)));

  template <class Cursor>
  Levels(const Sort& sort, const Cursor& text, size_t most_chars, uint8_t* space)
      : primaries(space),
        secondaries(space + most_chars * kPrimaryBytes + 1),
        tertiaries(secondaries.begin + most_chars * kByteLevelBytes + 1),
        specials(space + specials_at(most_chars)) {
    WeightSets<Cursor> sets(sort, text);
    for (Element set; sets.next(&set);) place(set, sets.position());
    chars = sets.consumed();
    primaries.close_run();
    secondaries.close_run();
    tertiaries.close_run();
    specials.close_run();
  }

 private:
  void place(const Element& set, uint16_t position) {
    const auto appends = [&](unsigned bit) { return (set.char_class() & bit) != 0; };
    if (set.primary() != 0) primaries.add(static_cast<uint16_t>(set.primary()), appends(LX_APPEND_PRIMARY));
    if (set.secondary() != 0)
      secondaries.add(static_cast<uint8_t>(set.secondary()), appends(LX_APPEND_SECONDARY));
    if (set.tertiary() != 0) tertiaries.add(static_cast<uint8_t>(set.tertiary()), appends(LX_APPEND_TERTIARY));
    if (set.special() != 0)
      specials.add({position, static_cast<uint16_t>(set.special())}, appends(LX_APPEND_SPECIAL));
  }
};

}  // namespace lx
