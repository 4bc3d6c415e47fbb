// Sort keys: byte strings whose order is that of collation. A key is the weights of a text level by level, a
// zero byte between two levels; in binary order it is the text, folded as the options ask.
#include <cstring>

#include "collate/lxkey.h"
#include "core/lxcall.h"
#include "text/lxwalk.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxsortkey");

constexpr int32_t kEmptyKeyBytes = 3;
constexpr size_t kShortText = 64;  // of so many characters weights are kept apart

/// The caller's buffer. It is used from a multiple of the alignment unit on: less than the whole size may be
/// usable, and only that counts when the key is fitted in.
struct Output {
  uint8_t* start;
  size_t size;
  uint8_t* aligned;
  size_t usable;

  Output(uint8_t* output, int32_t given) : start(output), size(given > 0 ? static_cast<size_t>(given) : 0) {
    const size_t shift = (0 - reinterpret_cast<uintptr_t>(output)) & (alignment() - 1);
    aligned = output + shift;
    usable = size > shift ? size - shift : 0;
  }
  static size_t alignment() { return globals.area->table_alignment; }

  /// Whether it can be the work area for a text of `chars` characters. Callers rely on its rest being cleared
  /// exactly then; twice as much as the special level needs is asked for.
  bool is_work_area(size_t chars) const {
    const size_t levels =
        (chars * Levels::kLevelBytes + Levels::kSeparators + alignment() - 1) & ~(alignment() - 1);
    return usable >= levels + chars * 2 * Levels::kSpecialBytes;
  }
};

/// The key of a text without a character, which only a text with an end inside its first one can be.
int32_t key_of_nothing(const Output& output) {
  if (output.size >= kEmptyKeyBytes) memset(output.start, 0, kEmptyKeyBytes);
  return kEmptyKeyBytes;
}

/// Ends a key that is in place, where the output may have been its work area.
int32_t finish_key(const Output& output, size_t bytes, size_t chars) {
  if (bytes <= output.usable && output.is_work_area(chars))
    memset(output.start + bytes, 0, output.size - bytes);
  return static_cast<int32_t>(bytes);
}

/// Drops the weights at the end of a level that each character has.
void trim_level(Level<uint8_t>* level, uint8_t common) {
  while (level->end != level->begin && level->end[-1] == common) --level->end;
}

uint8_t* write_level(uint8_t* output, const Level<uint8_t>& level) {
  memmove(output, level.begin, level.count());
  output += level.count();
  *output++ = 0;
  return output;
}

/// Takes the character behind one where the two are a pair, which has the element then.
template <class Cursor>
bool take_pair(const Sort& sort, LXUChar first, Cursor* in, Element* element) {
  LXUChar second = 0;
  Cursor behind(*in);
  if (!element->starts_pair() || !behind.next(&second) || !sort.pair(first, second, element)) return false;
  element->note_own_primary();
  go_on_at(*in, behind);
  return true;
}

/// The key of a short text of elements with a primary of their own and no special weight: its bytes, or 0 for another
/// text. Pairs are looked for when it is known that there may be some.
template <bool kPairs, class Cursor>
int32_t make_short_key(const Sort& sort, const Cursor& text, const Output& output) {
  constexpr unsigned kOrder = LX_APPEND_PRIMARY | LX_APPEND_SECONDARY | LX_APPEND_TERTIARY;
  uint8_t primaries[2 * kShortText + 1], second[kShortText + 1], third[kShortText + 1];
  uint8_t *primary = primaries, *secondary = second, *tertiary = third;
  ElementSummary summary;
  size_t pairs = 0;
  Cursor in(text);
  for (LXUChar u = 0; in.next(&u); primary += 2) {
    Element element = sort.noted_element(u);
    if constexpr (kPairs) pairs += take_pair(sort, u, &in, &element);
    put_le16(primary, __builtin_bswap16(static_cast<uint16_t>(element.primary())));
    // A weight that is 0 is written over.
    *secondary = static_cast<uint8_t>(element.secondary());
    secondary += element.secondary() != 0;
    *tertiary = static_cast<uint8_t>(element.tertiary());
    tertiary += element.tertiary() != 0;
    summary.add(element);
  }
  if (!kPairs && summary.may_have_pair()) return make_short_key<true>(sort, text, output);
  // All elements have to be alike in what they append.
  const unsigned appends = summary.all_append() & kOrder;
  const bool alike = appends == (summary.some_append() & kOrder) && (appends & LX_APPEND_PRIMARY) != 0;
  const size_t bytes_of_primaries = room(primaries, primary);
  if (bytes_of_primaries == 0 || !summary.plain() || !alike) return 0;
  *primary = 0;
  const auto finish = [&](uint8_t* begin, uint8_t* end, unsigned bit, uint8_t common) {
    Level<uint8_t> level(begin);
    level.end = end;
    if ((appends & bit) == 0) level.close_run();  // all of them were inserted
    trim_level(&level, common);
    return level;
  };
  const auto secondaries = finish(second, secondary, LX_APPEND_SECONDARY, sort.default_secondary);
  const auto tertiaries = finish(third, tertiary, LX_APPEND_TERTIARY, sort.default_tertiary);
  const size_t bytes = bytes_of_primaries + secondaries.count() + tertiaries.count() + Levels::kSeparators;
  if (bytes <= output.usable) {
    memcpy(output.start, primaries, bytes_of_primaries + 1);
    write_level(write_level(output.start + bytes_of_primaries + 1, secondaries), tertiaries);
  }
  return finish_key(output, bytes, bytes_of_primaries / 2 + pairs);
}

/// Makes the key of a text of at most `most_chars` characters: its bytes, or -1 without memory.
template <class Cursor>
int32_t make_key(const Sort& sort, const Cursor& text, size_t most_chars, const Output& output) {
  if constexpr (Cursor::kRuns)
    if (most_chars <= kShortText)
      if (const int32_t bytes = make_short_key<false>(sort, text, output)) return bytes;
  if (most_chars > Levels::kMostChars) return -1;
  LXUChar u = 0;
  const bool in_place = output.is_work_area(most_chars) && Cursor(text).next(&u);
  const WorkBuffer space(in_place ? 0 : Levels::bytes_for(most_chars));
  if (!space) return -1;
  const Key key(sort, text, most_chars, in_place ? output.aligned : space.as<uint8_t>());
  if (key.chars() == 0) return key_of_nothing(output);
  const size_t bytes = key.bytes();
  if (bytes <= output.usable) key.write(output.start);
  return finish_key(output, bytes, key.chars());
}

int32_t empty_key(uint8_t* output, int32_t size) {
  if (size <= 0) return 0;
  memset(output, 0, static_cast<size_t>(size < kEmptyKeyBytes ? size : kEmptyKeyBytes));
  return kEmptyKeyBytes;
}

/// In binary order: the text itself where it fits.
template <class Unit>
int32_t copy_text(uint8_t* output, int32_t size, const Unit* text, size_t units) {
  const size_t bytes = units * sizeof(Unit);
  if (size > 0 && bytes <= static_cast<size_t>(size)) memcpy(output, text, bytes);
  return static_cast<int32_t>(bytes);
}

/// In binary order with options: each folded character while it fits. `store(u, p)` writes one and returns its
/// bytes.
template <class Cursor, class Store>
int32_t write_folded(Cursor text, uint8_t* output, int32_t size, Store store) {
  size_t total = 0;
  for (LXUChar u = 0; text.next(&u);) {
    uint8_t character[sizeof(LXWChar)];
    const size_t bytes = store(u, character);
    if (size > 0 && total + bytes <= static_cast<size_t>(size)) memcpy(output + total, character, bytes);
    total += bytes;
  }
  return static_cast<int32_t>(total);
}

template <class Unit>
size_t store_unit(Unit value, uint8_t* p) {
  memcpy(p, &value, sizeof(value));
  return sizeof(value);
}

/// How a form stores a folded character in binary order.
template <class Cursor>
size_t store_character(const Codepage& cp, const Cursor&, LXUChar u, uint8_t* p) {
  return store_unicode(cp, u, p);
}
size_t store_character(const Codepage& cp, const CodeCursor&, LXUChar u, uint8_t* p) {
  return store_unit(unicode_to_code(cp, u), p);
}
size_t store_character(const Codepage&, const UnicodeCursor&, LXUChar u, uint8_t* p) {
  return store_unit(u, p);
}

/// The frame of all forms.
template <class Unit>
int32_t transform(LXLocale* given, Form form, uint8_t* output, int32_t size, const Text<Unit>& text,
                  uint32_t options) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, -1);
  const LXLocale& locale = *call.locale();
  const Codepage& cp = codepage_of(*locale.codepage);
  if (!is_fold(options & ~uint32_t{LX_CHARACTERS})) return call.fail(LX_E_INVALID, -1);
  const Fold fold = fold_of(options);
  const size_t units = units_of(cp, text, (options & LX_CHARACTERS) != 0);
  if (units == 0) return call.exit(empty_key(output, size));
  if (units > INT32_MAX / sizeof(Unit)) return call.fail(LX_E_MEMORY, -1);
  if (locale.sort == nullptr && fold == Fold::kNone) return call.exit(copy_text(output, size, text.p, units));
  const Folding folding(locale, fold);
  const int32_t bytes = with_cursor(cp, form, text, units, [&](const auto& in) {
    const auto write = [&](const auto& reader) {
      if (locale.sort != nullptr)
        return make_key(sort_of(*locale.sort), reader, folding.most_chars(units), Output(output, size));
      return write_folded(reader, output, size,
                          [&](LXUChar u, uint8_t* p) { return store_character(cp, in, u, p); });
    };
    return fold == Fold::kNone ? write(in) : write(FoldCursor<std::decay_t<decltype(in)>>{folding, in});
  });
  return bytes < 0 ? call.fail(LX_E_MEMORY, -1) : call.exit(bytes);
}

}  // namespace

namespace lx {

void Key::trim(const Sort& sort) {
  trim_level(&levels_.secondaries, sort.default_secondary);
  trim_level(&levels_.tertiaries, sort.default_tertiary);
  positions_ = levels_.primaries.count() + levels_.secondaries.count() + levels_.tertiaries.count() != 0;
}

size_t Key::bytes() const {
  const size_t special_bytes = sizeof(uint16_t) * (positions_ ? 2 : 1);
  return sizeof(uint16_t) * levels_.primaries.count() + levels_.secondaries.count() +
         levels_.tertiaries.count() + special_bytes * levels_.specials.count() + Levels::kSeparators;
}

void Key::write(uint8_t* output) const {
  const auto put = [&](uint16_t weight) {
    *output++ = static_cast<uint8_t>(weight >> 8);
    *output++ = static_cast<uint8_t>(weight);
  };
  for (const uint16_t* p = levels_.primaries.begin; p != levels_.primaries.end; ++p) put(*p);
  *output++ = 0;
  output = write_level(write_level(output, levels_.secondaries), levels_.tertiaries);
  for (const uint32_t* p = levels_.specials.begin; p != levels_.specials.end; ++p) {
    const uint32_t placed = *p;  // what is written may reach over it
    if (positions_) put(static_cast<uint16_t>(placed >> 16));
    put(static_cast<uint16_t>(placed));
  }
}

}  // namespace lx

extern "C" {

int32_t LXStrxfrm(LXLocale* locale, uint8_t* output, int32_t size, const char* text, int32_t length,
                  uint32_t options) {
  return transform(locale, Form::kPlain, output, size, text_of(text, length), options);
}

int32_t LXStrxfrmEx(LXLocale* locale, uint8_t* output, int32_t size, const char* text, LXShiftState state,
                    int32_t length, uint32_t options) {
  return transform(locale, Form::kEx, output, size, text_of(text, length, state), options);
}

int32_t LXWcsxfrm(LXLocale* locale, uint8_t* output, int32_t size, const LXWChar* text, int32_t length,
                  uint32_t options) {
  return transform(locale, Form::kPlain, output, size, text_of(text, length), options);
}

int32_t LXStrxfrmU(LXLocale* locale, uint8_t* output, int32_t size, const LXUChar* text, int32_t length,
                   uint32_t options) {
  return transform(locale, Form::kPlain, output, size, text_of(text, length), options);
}

int32_t LXStrGenSortKey(LXLocale* given, uint8_t* output, int32_t size, const LXUChar* text, int32_t count) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, -1);
  const LXLocale& locale = *call.locale();
  if (locale.sort == nullptr || count < 0) return call.fail(LX_E_INVALID, -1);
  if (count == 0) return call.exit(key_of_nothing(Output(output, size)));
  const UnicodeCursor reader{text, text + count};
  const int32_t bytes =
      make_key(sort_of(*locale.sort), reader, static_cast<size_t>(count), Output(output, size));
  return bytes < 0 ? call.fail(LX_E_MEMORY, -1) : call.exit(bytes);
}

}  // extern "C"
