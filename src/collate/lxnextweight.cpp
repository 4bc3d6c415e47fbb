// The walk over a text's weights for callers who take them one element at a time, and place them into levels of
// their own.
#include <cstring>

#include "collate/lxsort.h"
#include "core/lxcall.h"
#include "text/lxwalk.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxnextweight");

/// Where a caller stands in a text, and where the weights of the next element go.
template <class Unit>
struct Step {
  const Unit** text;
  LXShiftState* state;  // null in the forms without one
  int32_t* remaining;
  uint16_t* counter;
  LXWeights* first;
  LXWeights* second;
  uint8_t* char_class;
  LXUChar* look_ahead;

  bool has_ahead() const { return *look_ahead != kNoAhead; }
  /// The units behind the character that was read ahead.
  size_t units() const {
    const int32_t units = *remaining - (has_ahead() ? 1 : 0);
    return units > 0 ? static_cast<size_t>(units) : 0;
  }
};

/// Takes the next element of the text that `in` reads on.
template <class Cursor, class Unit>
int32_t take(const Sort& sort, const Cursor& in, const Step<Unit>& step) {
  Elements<Cursor, LookAhead::kAlways> elements(sort, in, *step.counter, *step.look_ahead);
  const Element element = elements.next();
  const bool cut = elements.position() == *step.counter;
  *step.remaining = 0;
  if (cut) return 0;
  *step.counter = elements.position();
  *step.look_ahead = elements.ahead();
  *step.text = reinterpret_cast<const Unit*>(elements.in().p);
  if (step.state != nullptr) *step.state = state_at(elements.in(), *step.state);
  if (!elements.at_end())
    *step.remaining = static_cast<int32_t>(room(elements.in().p, elements.in().end)) + step.has_ahead();
  if (element.sets() == 0) return 0;
  *step.char_class = static_cast<uint8_t>(element.char_class());
  return weight_sets(sort, element, step.first, step.second);
}

/// The frame of all forms.
template <class Unit>
int32_t next_weight(LXLocale* given, Form form, const Step<Unit>& step) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  const LXLocale& locale = *call.locale();
  if (locale.sort == nullptr) return call.fail(LX_E_INVALID, 0);
  const Sort& sort = sort_of(*locale.sort);
  auto text = text_of(*step.text, 0);
  if (step.state != nullptr) text.state = *step.state;
  return call.exit(with_cursor(codepage_of(*locale.codepage), form, text, step.units(),
                               [&](const auto& in) { return take(sort, in, step); }));
}

/// Places `places` values, which are one weight, into a level.
template <class Weight, size_t kPlaces>
void insert(const Weight (&weight)[kPlaces], Weight** insert_point, Weight** end, bool append) {
  Weight* const at = append ? *end : *insert_point;
  memmove(at + kPlaces, at, static_cast<size_t>(*end - at) * sizeof(Weight));
  memcpy(at, weight, sizeof(weight));
  *end += kPlaces;
  if (append) *insert_point = *end;
}

}  // namespace

extern "C" {

int32_t LXStrGetNextWeight(LXLocale* locale, const char** text, int32_t* remaining, uint16_t* counter,
                           LXWeights* first, LXWeights* second, uint8_t* char_class, LXUChar* look_ahead) {
  return next_weight<char>(locale, Form::kPlain,
                           {text, nullptr, remaining, counter, first, second, char_class, look_ahead});
}

int32_t LXStrGetNextWeightEx(LXLocale* locale, const char** text, LXShiftState* state, int32_t* remaining,
                             uint16_t* counter, LXWeights* first, LXWeights* second, uint8_t* char_class,
                             LXUChar* look_ahead) {
  return next_weight<char>(locale, Form::kEx,
                           {text, state, remaining, counter, first, second, char_class, look_ahead});
}

int32_t LXStrGetNextWeightW(LXLocale* locale, const LXWChar** text, int32_t* remaining, uint16_t* counter,
                            LXWeights* first, LXWeights* second, uint8_t* char_class, LXUChar* look_ahead) {
  return next_weight<LXWChar>(locale, Form::kPlain,
                              {text, nullptr, remaining, counter, first, second, char_class, look_ahead});
}

int32_t LXStrGetNextWeightU(LXLocale* locale, const LXUChar** text, int32_t* remaining, uint16_t* counter,
                            LXWeights* first, LXWeights* second, uint8_t* char_class, LXUChar* look_ahead) {
  return next_weight<LXUChar>(locale, Form::kPlain,
                              {text, nullptr, remaining, counter, first, second, char_class, look_ahead});
}

void LXStrInsertWeights(uint16_t primary, uint16_t** primary_insert, uint16_t** primary_end, uint8_t secondary,
                        uint8_t** secondary_insert, uint8_t** secondary_end, uint8_t tertiary,
                        uint8_t** tertiary_insert, uint8_t** tertiary_end, uint16_t special,
                        uint16_t** special_insert, uint16_t** special_end, uint16_t position,
                        uint8_t char_class) {
  const auto appends = [char_class](unsigned bit) { return (char_class & bit) != 0; };
  if (primary != 0) insert({primary}, primary_insert, primary_end, appends(LX_APPEND_PRIMARY));
  if (secondary != 0) insert({secondary}, secondary_insert, secondary_end, appends(LX_APPEND_SECONDARY));
  if (tertiary != 0) insert({tertiary}, tertiary_insert, tertiary_end, appends(LX_APPEND_TERTIARY));
  if (special != 0) insert({position, special}, special_insert, special_end, appends(LX_APPEND_SPECIAL));
}

}  // extern "C"
