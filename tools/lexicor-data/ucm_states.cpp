// A state table is a list of rows; a byte leads to another row or ends the character.
#include "ucm_states.h"

namespace lexicor_data {
namespace {

constexpr uint8_t kLongest = 4;
constexpr char kActions[] = "uspi";  // unassigned, shift, surrogate pair, illegal

}  // namespace

void UcmStates::read(UcmLine& line) {
  State state;
  state.fill(kIllegal);
  for (const char* mark : {"initial", "surrogates"})
    if (line.take(mark)) line.skip_blanks(), line.take(','), line.skip_blanks();
  while (!line.done()) {
    read_entry(line, state);
    line.skip_blanks();
    if (line.done()) break;
    line.expect(',', "a comma between ranges");
    line.skip_blanks();
  }
  states_.push_back(state);
}

void UcmStates::read_entry(UcmLine& line, State& state) const {
  const Position start = line.here();
  const uint32_t first = line.hex_number(1, 2);
  const uint32_t last = line.take('-') ? line.hex_number(1, 2) : first;
  if (last < first) line.fail(start, "the range runs backwards");
  int next = kEnds;
  if (line.take(':')) next = static_cast<int>(line.hex_number(1, 2));
  if (line.take('.')) {
    const char action = line.peek();
    bool known = false;
    for (const char* a = kActions; *a != 0; ++a) known = known || line.take(*a);
    if (!known) line.fail_expected("one of the letters u, s, p and i");
    next = action == 'i' ? kIllegal : kEnds;
  }
  for (uint32_t byte = first; byte <= last; ++byte) state[byte] = next;
}

uint8_t UcmStates::length(uint8_t first) const {
  unsigned found = 0;
  lengths(0, first, 1, found);
  for (uint8_t length = 1; length <= kLongest; ++length)
    if (found == 1u << length) return length;
  return 0;
}

void UcmStates::lengths(size_t state, unsigned byte, uint8_t length, unsigned& found) const {
  const int next = states_[state][byte];
  if (next == kIllegal || length > kLongest) return;
  if (next == kEnds) {
    found |= 1u << length;
    return;
  }
  if (static_cast<size_t>(next) >= states_.size()) return;
  // Most rows have few different entries: each is followed once.
  int before = kIllegal;
  for (unsigned trail = 0; trail < 256; ++trail) {
    const int entry = states_[static_cast<size_t>(next)][trail];
    if (entry != before) lengths(static_cast<size_t>(next), trail, static_cast<uint8_t>(length + 1), found);
    before = entry;
  }
}

}  // namespace lexicor_data
