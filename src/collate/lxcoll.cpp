// Collation: two strings compared by the weights of a sort. While every primary weight is appended the first
// primaries that differ decide, and nothing is stored. Only texts with equal primaries, and those with an
// inserted one, are compared level by level. With options, keys are compared.
#include <cstring>

#include "collate/lxkey.h"
#include "core/lxcall.h"
#include "locale/lxlocale.h"

namespace {

using lx::bytes_of;
using lx::Call;
using lx::Codepage;
using lx::codepage_of;
using lx::Element;
using lx::Fold;
using lx::Form;
using lx::Level;
using lx::Levels;
using lx::Sort;

RAS1_Unit unit = RAS1_UNIT("lxcoll");

constexpr uint32_t kBlanksOption = 0x1;  // part of LX_WIDTH_INSENSITIVE
constexpr uint32_t kTruncation = 0x00800000u | LX_WIDTH_INSENSITIVE;

/// One text while primaries decide.
template <class Reader>
struct Side {
  lx::Elements<Reader> elements;
  Element element{};
  LXWeights second{};
  bool pending = false;  // the second set of an expansion
  bool needs = true;     // an element

  Side(const Sort& sort, const Reader& text) : elements(sort, text) {}

  bool used_up() const { return !pending && elements.at_end(); }
  uint16_t primary() const { return element.weights.primary; }
  bool inserts() const { return primary() != 0 && (element.char_class & LX_APPEND_PRIMARY) == 0; }
  void take(const Sort& sort) {
    if (pending) {
      element.weights = second;
      pending = false;
      return;
    }
    element = elements.next();
    pending = element.sets == 2;
    if (pending) sort.expand(element, &element.weights, &second);
  }
  /// Whether a primary is left.
  bool has_primary_left(const Sort& sort) {
    while (!used_up()) {
      take(sort);
      if (primary() != 0) return true;
    }
    return false;
  }
};

/// Compares primaries in the order of the texts: the difference, or 0 with `*inserted` when the levels must be
/// compared, all of them or those behind the primaries.
template <class Reader>
int32_t compare_directly(const Sort& sort, const Reader& text1, const Reader& text2, bool* inserted) {
  Side<Reader> a(sort, text1);
  Side<Reader> b(sort, text2);
  *inserted = false;
  while (!(a.needs && a.used_up()) && !(b.needs && b.used_up())) {
    if (a.needs) a.take(sort);
    if (b.needs) b.take(sort);
    *inserted = (a.needs && a.inserts()) || (b.needs && b.inserts());
    if (*inserted) return 0;
    const int32_t primary1 = a.primary();
    const int32_t primary2 = b.primary();
    if (primary1 != 0 && primary2 != 0) {
      if (primary1 != primary2) return primary1 - primary2;
    } else if (primary1 != 0 && b.used_up()) {
      return 1;
    } else if (primary2 != 0 && a.used_up()) {
      return -1;
    }
    // A side holds its primary while the other one passes what it ignores.
    a.needs = primary1 == 0 || primary2 != 0;
    b.needs = primary2 == 0 || primary1 != 0;
  }
  if (b.used_up() && a.has_primary_left(sort)) return 1;
  if (a.used_up() && b.has_primary_left(sort)) return -1;
  return 0;
}

/// The longer of two levels with an equal beginning is the greater.
int32_t compare_bytes(const Level<uint8_t>& a, const Level<uint8_t>& b) {
  const int32_t difference = memcmp(a.begin, b.begin, lx::least(a.count(), b.count()));
  return difference != 0 ? difference : (a.count() > b.count()) - (a.count() < b.count());
}

/// Here it is not: primaries of different number with an equal beginning do not decide.
int32_t compare_primaries(const Level<uint16_t>& a, const Level<uint16_t>& b) {
  const size_t n = lx::least(a.count(), b.count());
  for (size_t i = 0; i < n; ++i)
    if (a.begin[i] != b.begin[i]) return a.begin[i] - b.begin[i];
  return 0;
}

int32_t compare_specials(const Level<lx::PlacedSpecial>& a, const Level<lx::PlacedSpecial>& b) {
  const size_t n = lx::least(a.count(), b.count());
  for (size_t i = 0; i < n; ++i) {
    if (a.begin[i].position != b.begin[i].position) return a.begin[i].position - b.begin[i].position;
    if (a.begin[i].weight != b.begin[i].weight) return a.begin[i].weight - b.begin[i].weight;
  }
  return (a.count() > b.count()) - (a.count() < b.count());
}

template <class Reader>
int32_t compare_levels(const Sort& sort, const Reader& text1, const Reader& text2, bool primaries,
                       int32_t* code) {
  const lx::LevelCounts counts1 = lx::count_weights(sort, text1);
  const lx::LevelCounts counts2 = lx::count_weights(sort, text2);
  const size_t bytes1 = (counts1.bytes() + 1) & ~size_t{1};
  const lx::WorkBuffer space(bytes1 + counts2.bytes());
  if (!space) {
    *code = LX_E_MEMORY;
    return 0;
  }
  const Levels a(sort, text1, counts1, space.as<uint8_t>());
  const Levels b(sort, text2, counts2, space.as<uint8_t>() + bytes1);
  if (primaries)
    if (const int32_t difference = compare_primaries(a.primaries, b.primaries)) return difference;
  if (const int32_t difference = compare_bytes(a.secondaries, b.secondaries)) return difference;
  if (const int32_t difference = compare_bytes(a.tertiaries, b.tertiaries)) return difference;
  return compare_specials(a.specials, b.specials);
}

template <class Reader>
int32_t compare_keys(const Sort& sort, const Reader& text1, const Reader& text2, int32_t* code) {
  const lx::LevelCounts counts[] = {lx::count_weights(sort, text1), lx::count_weights(sort, text2)};
  const lx::WorkBuffer space1(counts[0].bytes());
  const lx::WorkBuffer space2(counts[1].bytes());
  *code = LX_E_MEMORY;
  if (!space1 || !space2) return 0;
  const lx::Key key1(sort, text1, counts[0], space1.as<uint8_t>());
  const lx::Key key2(sort, text2, counts[1], space2.as<uint8_t>());
  const lx::WorkBuffer bytes1(key1.bytes());
  const lx::WorkBuffer bytes2(key2.bytes());
  if (!bytes1 || !bytes2) return 0;
  key1.write(bytes1.as<uint8_t>());
  key2.write(bytes2.as<uint8_t>());
  *code = LX_OK;
  const int32_t difference =
      memcmp(bytes1.as<void>(), bytes2.as<void>(), lx::least(key1.bytes(), key2.bytes()));
  return difference != 0 ? difference : (key1.bytes() > key2.bytes()) - (key1.bytes() < key2.bytes());
}

/// Compares two texts of one kind by the locale's sort, as `options` ask.
template <class Reader>
int32_t collate(const LXLocale& locale, const Reader& text1, const Reader& text2, uint32_t options,
                int32_t* code) {
  const Sort& sort = lx::sort_of(*locale.sort);
  Fold fold;
  if (!lx::fold_of(options, &fold)) {
    *code = LX_E_INVALID;
    return 0;
  }
  if (fold != Fold::kNone) {
    const lx::Folding folding(locale, fold);
    return compare_keys(sort, lx::FoldReader<Reader>{folding, text1}, lx::FoldReader<Reader>{folding, text2},
                        code);
  }
  bool inserted = false;
  if (const int32_t difference = compare_directly(sort, text1, text2, &inserted)) return difference;
  return compare_levels(sort, text1, text2, inserted, code);
}

/// A byte text that a collation function was given.
struct ByteText {
  const char* text;
  LXShiftState state;
  size_t bytes;
};

int32_t truncate(LXLocale* locale, char* copy, const ByteText& text, Form form) {
  const auto size = static_cast<int32_t>(text.bytes + 1);
  return form == Form::kEx ? LXTruncateStringEx(locale, copy, text.state, size, kTruncation)
                           : LXTruncateString(locale, copy, size, kTruncation);
}

/// Takes the blanks at the end out of both lengths. Of the second text no more is looked at than the first one
/// has left: what follows does not count. Existing results depend on it. Without memory blanks count.
void drop_blanks(LXLocale* locale, ByteText* text1, ByteText* text2, Form form) {
  const size_t longer = text1->bytes > text2->bytes ? text1->bytes : text2->bytes;
  if (longer >= INT32_MAX) return;
  const lx::WorkBuffer copy(longer + 1);
  if (!copy) return;
  char* const buffer = copy.as<char>();
  const auto drop = [&](ByteText* text, size_t copied) {
    memcpy(buffer, text->text, copied);
    buffer[copied] = '\0';
    text->bytes = static_cast<size_t>(truncate(locale, buffer, *text, form)) - 1;
  };
  drop(text1, text1->bytes);
  drop(text2, lx::least(text1->bytes, text2->bytes));
}

/// Both byte forms. `in_binary(call)` compares by code value where the locale has no sort.
template <class InBinary>
int32_t collate_bytes(LXLocale* given, ByteText text1, int32_t length1, ByteText text2, int32_t length2,
                      uint32_t options, Form form, InBinary in_binary) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  LXLocale* locale = call.locale();
  const Codepage& cp = codepage_of(*locale->codepage);
  text1.bytes = lx::text_bytes(cp, text1.text, text1.state, length1, options);
  text2.bytes = lx::text_bytes(cp, text2.text, text2.state, length2, options);
  options &= ~uint32_t{LX_CHARACTERS};
  if (locale->sort == nullptr) {
    // Comparison has its own error code.
    const int32_t difference = in_binary(text1, text2, options);
    return call.fail(locale->last_error, difference);
  }
  if ((options & kBlanksOption) != 0) {
    drop_blanks(locale, &text1, &text2, form);
    options &= ~LX_IGNORE_BLANKS;
  }
  int32_t code = LX_OK;
  const int32_t difference =
      lx::read_bytes(cp, form, text1.state, bytes_of(text1.text), text1.bytes, [&](const auto& in) {
        return collate(*locale, in, lx::read_like(in, bytes_of(text2.text), text2.bytes, text2.state), options,
                       &code);
      });
  return call.fail(code, difference);
}

/// The options that comparison by code value knows.
uint32_t binary_options(uint32_t options, bool knows_width) {
  const bool width = knows_width && (options & LX_WIDTH_INSENSITIVE) == LX_WIDTH_INSENSITIVE;
  return options & ((width ? LX_WIDTH_INSENSITIVE : LX_CASE_INSENSITIVE) | LX_IGNORE_BLANKS);
}

/// The units before the blanks at the end. `full_width` is the full-width blank, or the blank again.
template <class Unit>
size_t without_blanks(const Unit* text, size_t count, Unit blank, Unit full_width) {
  while (count > 0 && (text[count - 1] == blank || text[count - 1] == full_width)) --count;
  return count;
}

/// Both forms of one unit a character. `full_width(blank)` gives the full-width form of a blank; `reader(cp,
/// text, count)` the reader.
template <class Unit, class FullWidth, class MakeReader>
int32_t collate_units(Call* call, const Unit* text1, int32_t length1, const Unit* text2, int32_t length2,
                      uint32_t options, FullWidth full_width, MakeReader reader) {
  const LXLocale& locale = *call->locale();
  const Codepage& cp = codepage_of(*locale.codepage);
  size_t count1 = lx::text_units(text1, length1);
  size_t count2 = lx::text_units(text2, length2);
  if ((options & LX_IGNORE_BLANKS) != 0) {
    const Unit blank = lx::keeps_ascii(locale) ? 0x20 : 0x40;
    const bool width = (options & LX_WIDTH_INSENSITIVE) == LX_WIDTH_INSENSITIVE;
    const Unit full = width ? full_width(blank) : blank;
    count1 = without_blanks(text1, count1, blank, full);
    count2 = without_blanks(text2, count2, blank, full);
  }
  int32_t code = LX_OK;
  const int32_t difference = collate(locale, reader(cp, text1, count1), reader(cp, text2, count2),
                                     options & ~(LX_IGNORE_BLANKS | LX_CHARACTERS), &code);
  return call->fail(code, difference);
}

}  // namespace

extern "C" {

int32_t LXStrcoll(LXLocale* locale, const char* text1, int32_t length1, const char* text2, int32_t length2,
                  uint32_t options) {
  return collate_bytes(locale, {text1, LX_SHIFT_SINGLE, 0}, length1, {text2, LX_SHIFT_SINGLE, 0}, length2,
                       options, Form::kPlain, [&](const ByteText& a, const ByteText& b, uint32_t left) {
                         return LXStrcmp(locale, text1, static_cast<int32_t>(a.bytes), text2,
                                         static_cast<int32_t>(b.bytes), left);
                       });
}

int32_t LXStrcollEx(LXLocale* locale, const char* text1, LXShiftState state1, int32_t length1,
                    const char* text2, LXShiftState state2, int32_t length2, uint32_t options) {
  const LXLocale* used = lx::locale_of(locale);
  if (used == nullptr || !codepage_of(*used->codepage).shift_sensitive)
    return LXStrcoll(locale, text1, length1, text2, length2, options);
  return collate_bytes(locale, {text1, state1, 0}, length1, {text2, state2, 0}, length2, options, Form::kEx,
                       [&](const ByteText& a, const ByteText& b, uint32_t left) {
                         return LXStrcmpEx(locale, text1, state1, static_cast<int32_t>(a.bytes), text2, state2,
                                           static_cast<int32_t>(b.bytes), binary_options(left, true));
                       });
}

int32_t LXWcscoll(LXLocale* locale, const LXWChar* text1, int32_t length1, const LXWChar* text2,
                  int32_t length2, uint32_t options) {
  Call call(unit, locale);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  if (call.locale()->sort == nullptr) {
    const int32_t difference = LXWcscmp(locale, text1, length1, text2, length2, binary_options(options, false));
    return call.fail(call.locale()->last_error, difference);
  }
  const auto full_width = [&](LXWChar blank) {
    LXMapStringW(locale, &blank, 1, &blank, 1, LX_MAP_FULL_WIDTH);
    return blank;
  };
  return collate_units(&call, text1, length1, text2, length2, options, full_width,
                       [](const Codepage& cp, const LXWChar* text, size_t count) {
                         return lx::CodeReader{cp, text, text + count};
                       });
}

int32_t LXStrcollU(LXLocale* locale, const LXUChar* text1, int32_t length1, const LXUChar* text2,
                   int32_t length2, uint32_t options) {
  constexpr uint32_t kInvalidOptions = 0x7FDFFFBE;
  Call call(unit, locale);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, 0);
  if ((options & kInvalidOptions) != 0) return call.fail(LX_E_INVALID, 0);
  if (call.locale()->sort == nullptr) {
    const int32_t difference = LXStrcmpU(locale, text1, length1, text2, length2, binary_options(options, true));
    return call.fail(call.locale()->last_error, difference);
  }
  const auto full_width = [&](LXUChar blank) {
    LXMapStringU(locale, &blank, 1, &blank, 1, LX_MAP_FULL_WIDTH);
    return blank;
  };
  return collate_units(&call, text1, length1, text2, length2, options, full_width,
                       [](const Codepage&, const LXUChar* text, size_t count) {
                         return lx::UnicodeReader{text, text + count};
                       });
}

}  // extern "C"
