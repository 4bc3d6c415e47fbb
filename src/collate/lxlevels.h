// The weights of a text laid out level by level, as keys need them, and comparison where weights are inserted.
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
  void add(uint32_t weight, bool append) {
    if (weight == 0) return;
    if (append) close_run();
    *end++ = static_cast<Weight>(weight);
    if (append) run = end;
  }
  /// The same where nothing is inserted; without a branch, as a weight that is 0 is written over.
  void append(uint32_t weight) {
    *end = static_cast<Weight>(weight);
    end += weight != 0;
    run = end;
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

/// The four levels of a text of at most `most_chars` characters, in a space of bytes_for(most_chars) bytes that
/// is aligned to 4 bytes. The levels stand in the order of a key, a byte between two of them, so that one can
/// be made of them in place:
///
///   primaries     |0| secondaries |0| tertiaries |0| up to 3 bytes | specials, each with its position
///   4 bytes a char    2               2                              4
struct Levels {
  Level<uint16_t> primaries;
  Level<uint8_t> secondaries;
  Level<uint8_t> tertiaries;
  Level<uint32_t> specials;  // placed_special() of each
  size_t chars;              // of the text

  // A character has up to two weight sets, or one special weight.
  static constexpr size_t kPrimaryBytes = 2 * sizeof(uint16_t);
  static constexpr size_t kByteLevelBytes = 2;
  static constexpr size_t kLevelBytes = kPrimaryBytes + 2 * kByteLevelBytes;
  static constexpr size_t kSpecialBytes = sizeof(uint32_t);
  static constexpr size_t kSeparators = 3;

  static constexpr size_t specials_at(size_t chars) {
    return (chars * kLevelBytes + kSeparators + 3) & ~size_t{3};
  }
  static constexpr size_t bytes_for(size_t chars) { return specials_at(chars) + chars * kSpecialBytes; }
  static constexpr size_t kMostChars = INT32_MAX / (2 * (kLevelBytes + kSpecialBytes));

  template <class Cursor>
  Levels(const Sort& sort, const Cursor& text, size_t most_chars, uint8_t* space)
      : primaries(space),
        secondaries(space + most_chars * kPrimaryBytes + 1),
        tertiaries(secondaries.begin + most_chars * kByteLevelBytes + 1),
        specials(space + specials_at(most_chars)) {
    WeightSets<Cursor> sets(sort, text);
    if (sort.appends_all) {
      while (!sets.at_end()) {
        const Element set = sets.next();
        append(set, sets.position());
      }
    } else {
      while (!sets.at_end()) {
        const Element set = sets.next();
        place(set, sets.position());
      }
    }
    chars = sets.consumed();
    primaries.close_run();
    secondaries.close_run();
    tertiaries.close_run();
    specials.close_run();
  }

 private:
  void append(const Element& set, uint16_t position) {
    primaries.append(set.primary());
    secondaries.append(set.secondary());
    tertiaries.append(set.tertiary());
    specials.append(set.placed_special(position));
  }
  void place(const Element& set, uint16_t position) {
    primaries.add(set.primary(), set.appends(LX_APPEND_PRIMARY));
    secondaries.add(set.secondary(), set.appends(LX_APPEND_SECONDARY));
    tertiaries.add(set.tertiary(), set.appends(LX_APPEND_TERTIARY));
    specials.add(set.placed_special(position), set.appends(LX_APPEND_SPECIAL));
  }
};

/// Room for the levels of two texts of at most so many characters each; false where there is none.
struct LevelSpace {
  WorkBuffer first;
  WorkBuffer second;
  bool counted;

  LevelSpace(size_t chars1, size_t chars2)
      : first(bytes_for(chars1)),
        second(bytes_for(chars2)),
        counted(chars1 <= Levels::kMostChars && chars2 <= Levels::kMostChars) {}
  explicit operator bool() const { return first && second && counted; }

 private:
  static size_t bytes_for(size_t chars) { return Levels::bytes_for(least(chars, Levels::kMostChars)); }
};

}  // namespace lx
