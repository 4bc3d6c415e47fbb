// Times from text: the text is matched against the format character by character, and the directives fill the
// fields of the record. One walk for all kinds of text; nested formats are matched the same way.
#include "core/lxcall.h"
#include "format/lxtimetext.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxtimeparse");

constexpr uint32_t kFlags = LX_TERRITORY_VALUES | LX_CHARACTERS;

enum class Match { kSame, kDifferent, kCut };

/// Compares the character of several units or of a state, that `format` has just read, with the text and moves over it.
/// kCut: the text ends before it does.
template <class Cursor>
Match match_char(const Cursor& format, const uint8_t* before, Cursor* text) {
  Cursor at = *text;
  size_t count = room(before, format.p);
  if constexpr (Cursor::kShifts) {
    count = format.cp.width_in(format.state);
    at.pass_shift();
  }
  if (count > room(at.p, at.end)) return Match::kCut;
  if (state_at(at, LX_SHIFT_SINGLE) != state_at(format, LX_SHIFT_SINGLE)) return Match::kDifferent;
  // A single byte apart: not worth a call.
  if (count == 1 ? *at.p != format.p[-1] : memcmp(at.p, format.p - count, count) != 0) return Match::kDifferent;
  at.p += count;
  go_on_at(*text, at);
  return Match::kSame;
}

template <class Text>
class TimeParser {
  using Unit = typename Text::Unit;
  using Value = typename Text::Value;
  using Cursor = typename Text::Cursor;

 public:
  TimeParser(const LXLocale& locale, LXTime* time, bool current)
      : locale_(locale), time_(*time), symbols_(time_symbols<Text>(locale)), current_(current) {}

  /// The code; the text stands behind what was read.
  int32_t match(Cursor format, Cursor* text, int depth = 0) {
    bool afternoon = false;
    Value value{};
    Cursor at = *text;  // a copy, as is what other functions move: this one stays in registers
    const TimeSymbols& symbols = symbols_;
    const unsigned below = at.same_below();
    int32_t code = LX_OK;
    while (code == LX_OK && has_more(format) && has_more(at)) {
      const Unit* const before = format.p;
      if (Cursor::kOneUnit || (!Cursor::kShifts && *before < below)) {
        value = *format.p++;
        if (value != symbols.percent) {
          code = value == *at.p++ ? LX_OK : LX_E_NOT_FOUND;
          continue;
        }
      } else if constexpr (!Cursor::kOneUnit) {
        if (!format.next(&value)) break;
        if (!is_percent(format, value, symbols)) {
          const Match found = match_char(format, before, &at);
          if (found == Match::kDifferent) code = LX_E_NOT_FOUND;
          if (found == Match::kCut) break;
          continue;
        }
      }
      bool flag = false;
      const TimeDirective& directive = take_directive(&format, symbols, &flag, &value);
      if (directive.digits != 0) {
        code = read_number(directive, symbols.zero, &at);
      } else {
        Cursor moved = at;
        code = directive.field.member != nullptr ? read_name(directive, &moved, &afternoon)
                                                 : read_nested(directive, flag, value, &moved, depth);
        go_on_at(at, moved);
      }
    }
    go_on_at(*text, at);
    if (code != LX_OK) return code;
    if (afternoon && time_.hours <= 11) time_.hours += 12;
    if constexpr (Cursor::kShifts)
      if (text->state == LX_SHIFT_DOUBLE && text->p != text->end && *text->p == text->cp.shift_in)
        text->pass_shift();
    return LX_OK;
  }

 private:
  [[gnu::noinline]] int32_t read_name(const TimeDirective& directive, Cursor* text, bool* afternoon) {
    int32_t index = 0;
    if (!read_word(directive, text, &index)) return LX_E_NOT_FOUND;
    if (directive.action == TimeAction::kMarker)
      *afternoon = index != 0;
    else
      time_.*directive.field.member = index;
    return LX_OK;
  }

  /// A number is stored also when it is too large.
  int32_t read_number(const TimeDirective& directive, uint32_t zero, Cursor* text) {
    if (directive.action == TimeAction::kWeek) return LX_E_FORMAT;
    int32_t number = 0;
    int digits = 0;
    Cursor at = *text;
    Value value{};
    for (; digits < directive.digits && at.next(&value) && read_single(at); ++digits) {
      const uint32_t digit = uint32_t{value} - zero;
      if (digit > 9) break;
      number = number * 10 + static_cast<int32_t>(digit);
      go_on_at(*text, at);
    }
    if (digits == 0) return LX_E_NOT_FOUND;
    const bool noon = directive.action == TimeAction::kHour12 && number == 12;
    time_.*directive.field.member = noon ? 0 : number - directive.read_added;
    return number > directive.read_most ? LX_E_NOT_FOUND : LX_OK;
  }

  [[gnu::noinline]] int32_t read_nested(const TimeDirective& directive, bool flag, Value percent, Cursor* text,
                                        int depth) {
    const int32_t date = flag ? LX_ITEM_LONG_DATE_FORMAT : LX_ITEM_SHORT_DATE_FORMAT;
    Value value{};
    switch (directive.action) {
      case TimeAction::kPercent:
        return text->next(&value) && value == percent && read_single(*text) ? LX_OK : LX_E_NOT_FOUND;
      case TimeAction::kDate:
        return match_item(date, text, depth);
      case TimeAction::kTime:
        return match_item(LX_ITEM_TIME_FORMAT, text, depth);
      case TimeAction::kDateTime: {
        const int32_t code = match_item(date, text, depth);
        if (code != LX_OK) return code;
        if (!text->next(&value)) return LX_E_NOT_FOUND;
        return match_item(LX_ITEM_TIME_FORMAT, text, depth);
      }
      default:
        return LX_E_FORMAT;
    }
  }

  int32_t match_item(int32_t item, Cursor* text, int depth) {
    if (!has_more(*text)) return LX_OK;
    if (depth == kMostNestedFormats) return LX_E_FORMAT;
    const TimeItem<Text> format(locale_, item, current_);
    return match(format.cursor(locale_), text, depth + 1);
  }

  /// Reads the longest of the directive's items that the text has, of equal ones the first.
  bool read_word(const TimeDirective& directive, Cursor* text, int32_t* index) {
    Cursor longest = *text;
    for (int32_t i = 0; i < directive.items; ++i) {
      if (begins_otherwise(directive.first_item + i, *text)) continue;
      const TimeItem<Text> item(locale_, directive.first_item + i, current_);
      Cursor at = *text;
      if (!passes(item, &at) || at.p <= longest.p) continue;
      go_on_at(longest, at);
      *index = i;
    }
    const bool found = longest.p != text->p;
    go_on_at(*text, longest);
    return found;
  }

  /// Whether the text begins with another character than a name for certain.
  bool begins_otherwise(int32_t item, const Cursor& text) const {
    if constexpr (Cursor::kShifts || sizeof(Unit) > sizeof(LXUChar)) return false;
    const LXUChar first = le16(time_name(locale_, item));
    return first < text.same_below() && text.p != text.end && *text.p != first;
  }

  /// Whether the text has an item's characters; `at` moves over them.
  bool passes(const TimeItem<Text>& item, Cursor* at) const {
    if constexpr (!Cursor::kShifts) {
      if (item.count > room(at->p, at->end)) return false;
      if (memcmp(at->p, item.units, item.count * sizeof(Unit)) != 0) return false;
      at->p += item.count;
    } else {
      Cursor in = item.cursor(locale_);
      Value value{};
      while (in.next(&value))
        if (match_char(in, in.p, at) != Match::kSame) return false;
    }
    return true;
  }

  const LXLocale& locale_;
  LXTime& time_;
  const TimeSymbols& symbols_;
  const bool current_;
};

template <class Unit>
int32_t parse_time(LXLocale* given, LXTime* time, const Text<Unit>& text, const Text<Unit>& format,
                   uint32_t flags, Form form) {
  Call call(unit, given);
  if (!call) return call.fail(LX_E_NOT_INITIALIZED, -1);
  if ((flags & ~kFlags) != 0) return call.fail(LX_E_INVALID, -1);
  const LXLocale& locale = *call.locale();
  const Codepage& cp = codepage_of(*locale.codepage);
  const bool characters = sizeof(Unit) == 1 && (flags & LX_CHARACTERS) != 0;
  int32_t code = LX_OK;
  const int32_t read = with_kind<Unit, ClosedShiftSink>(cp, form, [&](auto kind) {
    using Kind = decltype(kind);
    const auto start = given_text<Kind>(cp, text, characters);
    const auto wanted = given_text<Kind>(cp, format, characters);
    if (start.p == start.end || wanted.p == wanted.end) return 0;
    auto in = start;
    code = TimeParser<Kind>(locale, time, (flags & LX_TERRITORY_VALUES) == 0).match(wanted, &in);
    if (code != LX_OK) return -1;
    size_t taken = room(start.p, in.p);
    if (characters) {
      auto counted = Kind::cursor(cp, start.p, taken, text.state);
      taken = pass_all(&counted);
    }
    return static_cast<int32_t>(taken);
  });
  return call.end(code, read);
}

}  // namespace

extern "C" {

int32_t LXStringToTime(LXLocale* locale, LXTime* time, const char* text, int32_t length, const char* format,
                       int32_t format_length, uint32_t flags) {
  return parse_time(locale, time, text_of(text, length), text_of(format, format_length), flags, Form::kPlain);
}

int32_t LXStringToTimeW(LXLocale* locale, LXTime* time, const LXWChar* text, int32_t length,
                        const LXWChar* format, int32_t format_length, uint32_t flags) {
  return parse_time(locale, time, text_of(text, length), text_of(format, format_length), flags, Form::kWide);
}

int32_t LXStringToTimeU(LXLocale* locale, LXTime* time, const LXUChar* text, int32_t length,
                        const LXUChar* format, int32_t format_length, uint32_t flags) {
  return parse_time(locale, time, text_of(text, length), text_of(format, format_length), flags, Form::kUnicode);
}

int32_t LXStringToTimeEx(LXLocale* locale, LXTime* time, const char* text, LXShiftState state, int32_t length,
                         const char* format, LXShiftState format_state, int32_t format_length, uint32_t flags) {
  return parse_time(locale, time, text_of(text, length, state), text_of(format, format_length, format_state),
                    flags, Form::kEx);
}

}  // extern "C"
