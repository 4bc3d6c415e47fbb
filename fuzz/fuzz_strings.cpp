// The string family: in all four forms it finds, spans, copies and divides as a model of 16-bit units does, where the
// codepage has the characters; of any units nothing beyond their blocks is touched.
#include <cstring>

#include "fuzz.h"

namespace lx::fuzz::strings {
namespace {

/// A text as an argument: a part of it, all of it, or either up to its null.
template <class F>
struct Argument {
  using Unit = typename F::Unit;

  Argument(Input& in, const F& form, const Place& at, uint32_t flags, LXShiftState state) {
    Text<Unit> text = in.text(form, at.locale, 40);
    const uint32_t kind = in.below(4);
    if (kind % 3 == 0) text.resize(in.below(static_cast<uint32_t>(text.size()) + 1));
    const bool to_null = kind % 2 == 1;
    length = to_null ? -1 : count_of(text);
    const bool chars = (flags & LX_CHARACTERS) != 0 && sizeof(Unit) == 1;
    if (chars && !to_null) length = length_in_chars(at.codepage, text.data(), state, length);
    if (chars || to_null) text.push_back(0);  // a shift byte is looked for behind the last character
    block = Block<Unit>(text);
  }
  Unit* data() const { return block.data(); }

  Block<Unit> block{0};
  int32_t length = 0;
};

/// The bytes that the first characters of a text take, its null among them.
size_t bytes_of_copy(const Place& at, std::string text, LXShiftState state, int32_t chars) {
  const int32_t whole = length_in_chars(at.codepage, text.data(), state, count_of(text));
  text += '\0';  // a shift byte is looked for behind the last character
  return static_cast<size_t>(LXCpStrCharToByteLen(at.codepage, text.data(), state, std::min(chars, whole)));
}

template <class F>
void call_all(Input& in, const F& form, const Place& at) {
  using Unit = typename F::Unit;
  LXLocale* const l = at.locale;
  const uint32_t flags = in.one_of({0u, uint32_t{LX_CHARACTERS}, 0u, 1u});
  const uint32_t options = flags | in.one_of({0u, LX_CASE_INSENSITIVE, LX_WIDTH_INSENSITIVE, LX_IGNORE_BLANKS});
  states = {};
  if (at.shift && std::is_same_v<F, Ex>) states.text = in.below(2), states.second = in.below(2);
  const Argument<F> text(in, form, at, flags, states.text), other(in, form, at, flags, states.second);
  const LXShiftState text_state = states.text;
  const auto size = static_cast<int32_t>(in.below(50));
  const bool chars = (flags & LX_CHARACTERS) != 0 && sizeof(Unit) == 1;
  const size_t room = chars ? at.units_of_chars<Unit>(static_cast<size_t>(size)) : static_cast<size_t>(size);
  const Unit* const found =
      form.chr(l, text.data(), text.length, static_cast<typename F::Char>(in.number(4)), flags);
  must(found == nullptr || text.block.has(found), "a character is found in the text");
  for (const auto span : {form.spn(l, text.data(), text.length, other.data(), other.length, flags),
                          form.cspn(l, text.data(), text.length, other.data(), other.length, flags)})
    must(span >= -1 && span <= text.block.size(), "a span is in the text");
  const Unit* const part =
      form.str(l, text.data(), text.length, other.data(), other.length, options & ~LX_IGNORE_BLANKS);
  must(part == nullptr || text.block.has(part), "a part is found in the text");
  form.cmp(l, text.data(), text.length, other.data(), other.length, options);
  size_t copied = room;
  if constexpr (sizeof(Unit) == 1)
    if (chars)
      copied = bytes_of_copy(at, {text.data(), static_cast<size_t>(text.block.size())}, text_state, size);
  const Block<Unit> copy(copied);
  must(form.cpy(l, copy.data(), size, text.data(), text.length, flags) <= size, "a copy fits");
  const Block<Unit> joined(room);
  if (room != 0) joined.data()[in.below(static_cast<uint32_t>(room))] = 0;
  const int32_t used = form.cat(l, joined.data(), size, text.data(), text.length, flags);
  must(used <= size, "a join fits");
  if constexpr (sizeof(Unit) == 1) {
    const Block<Unit> cut(Text<Unit>(other.data(), static_cast<size_t>(other.block.size())) + '\0');
    const int32_t rest =
        form.truncate(l, cut.data(),
                      chars ? std::min(size, length_in_chars(at.codepage, cut.data(), states.text,
                                                             static_cast<int32_t>(strlen(cut.data()))))
                            : size,
                      flags | (in.flag() ? LX_DROP_FULL_BLANKS : 0));
    // The null is no character in a double-byte state left open, nor behind half a character.
    must(rest >= (chars ? 0 : 1) && rest <= cut.size(), "a string is cut");
  }
  // Tokens are written to, the last thing that is done with a text.
  Unit* next = text.data();
  states.result = text_state;
  int32_t left = text.length;
  for (int32_t tokens = 0; next != nullptr; ++tokens) {
    Unit* const token = form.tok(l, next, &left, other.data(), other.length, &next, flags);
    must(token == nullptr || text.block.has(token), "a token is in the text");
    must(next == nullptr || text.block.has(next), "so is the rest");
    must(tokens <= text.block.size(), "tokens come to an end");
  }
}

/// A text of a form, and how many of its characters stand before a place.
template <class F>
struct Said {
  Said(const F& form, LXLocale* l, const Units& text) : locale(l), block(encode(form, l, text)) {}
  int32_t chars(const typename F::Unit* end) const {
    const auto count = static_cast<int32_t>(end - block.data());
    if constexpr (sizeof(typename F::Unit) == 1) return LXNumCharsEx(locale, block.data(), 0, count);
    return count;
  }
  LXLocale* locale;
  Block<typename F::Unit> block;
};

size_t model_tokens(const Units& text, const Units& set) {
  size_t count = 0;
  for (size_t at = 0; (at = text.find_first_not_of(set, at)) != Units::npos; ++count)
    at = std::min(text.find_first_of(set, at), text.size());
  return count;
}

/// Where all is said that the units say, a form does what a model of units does. `text` and `set` have no null.
template <class F>
void like_the_model(const F& form, const Place& at, const Units& text, const Units& set) {
  using Unit = typename F::Unit;
  LXLocale* const l = at.locale;
  states = {};
  const Said<F> said(form, l, text), said_set(form, l, set);
  const auto same_place = [&](const Unit* found, size_t expected) {
    must((found == nullptr) == (expected == Units::npos), "found in all forms or in none");
    must(found == nullptr || said.chars(found) == static_cast<int32_t>(expected), "at the same character");
  };
  const Block<LXWChar> codes(encode(kWide, l, set));
  const LXWChar wanted = std::is_same_v<F, Unicode> ? set[0] : codes.data()[0];
  same_place(form.chr(l, said.block.data(), said.block.size(), static_cast<typename F::Char>(wanted), 0u),
             text.find(set[0]));
  same_place(
      form.str(l, said.block.data(), said.block.size(), said_set.block.data(), said_set.block.size(), 0u),
      text.find(set));
  const auto span_of = [&](int32_t units) {
    return static_cast<size_t>(said.chars(said.block.data() + units));
  };
  must(span_of(form.spn(l, said.block.data(), said.block.size(), said_set.block.data(), said_set.block.size(),
                        0u)) == std::min(text.find_first_not_of(set), text.size()),
       "a span is that of the model");
  must(span_of(form.cspn(l, said.block.data(), said.block.size(), said_set.block.data(), said_set.block.size(),
                         0u)) == std::min(text.find_first_of(set), text.size()),
       "so is the other one");
  const int32_t order =
      form.cmp(l, said.block.data(), said.block.size(), said_set.block.data(), said_set.block.size(), 0u);
  const int32_t mirror =
      form.cmp(l, said_set.block.data(), said_set.block.size(), said.block.data(), said.block.size(), 0u);
  must((order == 0) == (text == set), "only what is equal compares equal");
  must((order < 0) == (mirror > 0), "the other way round it is the other way");
  for (int32_t size = 0; size <= std::min(said.block.size(), 12); ++size) {
    const auto copied = written<Unit>(
        [&](Unit* to, int32_t room) { return form.cpy(l, to, room, said.block.data(), said.block.size(), 0u); },
        static_cast<size_t>(size));
    states = {};
    must(text.compare(0, decode(form, l, copied).size(), decode(form, l, copied)) == 0,
         "a copy is a beginning");
  }
  states = {};
  size_t tokens = 0;
  const Said<F> divided(form, l, text);
  Unit* next = divided.block.data();
  for (int32_t left = divided.block.size(); next != nullptr; ++tokens)
    if (form.tok(l, next, &left, said_set.block.data(), said_set.block.size(), &next, 0u) == nullptr) break;
  must(tokens == model_tokens(text, set), "there are as many tokens");
}

void without_nulls(Units& text) {
  text.erase(std::remove(text.begin(), text.end(), 0), text.end());
}

}  // namespace

FUZZ_TARGET(strings) {
  const Place& at = place(in);
  if (in.flag()) {
    in_all_forms([&](const auto& form) { call_all(in, form, at); });
    char end[2];
    const LXShiftState state = in.below(2);
    must(LXTerminateStringEx(at.locale, end, state, in.below(2) * LX_TERMINATE) <= 2, "an end has two bytes");
    return;
  }
  Units text = in.units(60), set = in.units(6);
  without_nulls(text), without_nulls(set);
  if (text.empty() || set.empty()) return;
  must(LXStrlenU(at.locale, text.c_str()) == count_of(text), "a string has its length");
  must(LXWcslen(at.locale, Text<LXWChar>(encode(kWide, at.locale, text)).c_str()) <= count_of(text),
       "so have codes");
  // A shift byte of the codepage is a character in the model only.
  if (!faithful(kEx, at.locale, text, encode(kEx, at.locale, text)) ||
      !faithful(kEx, at.locale, set, encode(kEx, at.locale, set)))
    return;
  in_all_forms([&](const auto& form) {
    if (!at.shift || !std::is_same_v<std::decay_t<decltype(form)>, Plain>) like_the_model(form, at, text, set);
  });
}

}  // namespace lx::fuzz::strings
