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

/// How many weights a text has on each level.
struct LevelCounts {
  size_t primaries = 0, secondaries = 0, tertiaries = 0, specials = 0;

  void add(const LXWeights& w) {
    primaries += w.primary != 0;
    secondaries += w.secondary != 0;
    tertiaries += w.tertiary != 0;
    specials += w.special != 0;
  }
  size_t bytes() const {
    return sizeof(PlacedSpecial) * specials + sizeof(uint16_t) * primaries + secondaries + tertiaries;
  }
};

/// Gives `visit(weights, class, position)` every weight set of a text.
template <class Reader, class Visit>
void visit_weights(const Sort& sort, const Reader& text, Visit visit) {
  for (Elements<Reader> elements(sort, text); !elements.at_end();) {
    const Element element = elements.next();
    if (element.sets == 1) visit(element.weights, element.char_class, elements.position());
    if (element.sets != 2) continue;
    LXWeights first, second;
    sort.expand(element, &first, &second);
    visit(first, element.char_class, elements.position());
    visit(second, element.char_class, elements.position());
  }
}

template <class Reader>
LevelCounts count_weights(const Sort& sort, const Reader& text) {
  LevelCounts counts;
  visit_weights(sort, text, [&](const LXWeights& w, unsigned, uint16_t) { counts.add(w); });
  return counts;
}

/// The four levels of a text, in a space of LevelCounts::bytes() aligned to 2 bytes.
struct Levels {
  Level<PlacedSpecial> specials;
  Level<uint16_t> primaries;
  Level<uint8_t> secondaries;
  Level<uint8_t> tertiaries;

  template <class Reader>
  Levels(const Sort& sort, const Reader& text, const LevelCounts& counts, uint8_t* space)
      : specials(space),
        primaries(specials.begin + counts.specials),
        secondaries(primaries.begin + counts.primaries),
        tertiaries(secondaries.begin + counts.secondaries) {
    visit_weights(sort, text,
                  [this](const LXWeights& w, unsigned c, uint16_t position) { place(w, c, position); });
    primaries.close_run();
    secondaries.close_run();
    tertiaries.close_run();
    specials.close_run();
  }

 private:
  void place(const LXWeights& w, unsigned char_class, uint16_t position) {
    if (w.primary != 0) primaries.add(w.primary, (char_class & LX_APPEND_PRIMARY) != 0);
    if (w.secondary != 0) secondaries.add(w.secondary, (char_class & LX_APPEND_SECONDARY) != 0);
    if (w.tertiary != 0) tertiaries.add(w.tertiary, (char_class & LX_APPEND_TERTIARY) != 0);
    if (w.special != 0) specials.add({position, w.special}, (char_class & LX_APPEND_SPECIAL) != 0);
  }
};

}  // namespace lx
