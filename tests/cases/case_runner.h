// What a family of cases sees of one case in one form, codepage and way of giving lengths, and how it says what
// came out.
#pragma once

#include <map>
#include <string>
#include <vector>

#include "support/case_file.h"
#include "support/case_test.h"

namespace lx::test {

/// A text for a call, in a block of its exact size.
template <class Unit>
struct CaseInput {
  std::vector<Unit> block;
  int32_t length;             // as the call gets it
  std::vector<size_t> start;  // of each character; empty for a raw text
  const CaseText* text;
  const Unit* data() const { return block.data(); }
};

/// The flags and options that words of cases stand for.
uint32_t case_flags(const CaseWords& words);

template <class F>
struct CaseRun {
  using Form = F;
  using Unit = typename F::Unit;
  static constexpr F form{};
  const Case& c;
  const TinyCodepage& cp;
  CaseLibrary& library;
  LXLocale* l;
  bool null;       // texts are null-terminated; otherwise their lengths are given
  uint32_t flags;  // of the words
  int32_t error;   // that the locale has at the end
  bool once;       // what is written is not written again with a null, which would change the room

  static constexpr bool kBytes = sizeof(Unit) == 1;
  static constexpr Unit kCanary = static_cast<Unit>(0xA5A5A5A5);
  const CaseWords& given() const { return c.given; }
  const CaseWords& expected() const { return c.expected; }

  std::vector<Unit> units(const CaseText& text, LXShiftState state = 0) const {
    if (text.values.empty()) return {};
    if (!text.raw()) return Encoded<F>(cp, text.units(), state).units;
    const std::string bytes = text.bytes(cp);
    return {bytes.begin(), bytes.end()};
  }
  /// The next text of this name, "length" (with the name behind it) units long or as long as it is.
  CaseInput<Unit> input(const std::string& name = "", LXShiftState state = 0,
                        const std::string& number = "length") {
    const CaseText& text = c.given.text(name);
    CaseInput<Unit> in{units(text, state), 0, {}, &text};
    if (!text.raw()) in.start = Encoded<F>(cp, text.units(), state).start;
    const bool chars = (flags & LX_CHARACTERS) != 0;
    const int32_t whole = chars ? count_of(text.values) : count_of(in.block);
    in.length = c.given.number(number, null ? -1 : whole);
    if (in.length < 0) in.block.push_back(0);
    // A count of characters looks at the byte behind the last one.
    if (kBytes && chars && in.length >= 0) in.block.push_back(kCanary);
    in.block.shrink_to_fit();
    in.block.reserve(1);  // a null pointer is no text
    return in;
  }
  /// The code of a text of one character.
  typename F::Char character() {
    const CaseText& text = c.given.text();
    return static_cast<typename F::Char>(Encoded<F>(cp, text.units()).codes.at(0));
  }

  /// A number, or its sign.
  void number(int64_t got) {
    const std::string word = c.expected.word();
    if (word == "<" || word == ">")
      EXPECT_EQ(word, got < 0 ? "<" : got > 0 ? ">" : "=") << got;
    else
      EXPECT_EQ(got, std::strtoll(word.c_str(), nullptr, 0));
  }
  /// A place in a text: the number of its character, of a raw text its byte, or "none".
  void place(const Unit* got, const CaseInput<Unit>& in) {
    const std::string word = c.expected.word();
    if (word == "none") {
      EXPECT_EQ(got, nullptr);
      return;
    }
    const size_t at = std::stoul(word);
    EXPECT_EQ(got - in.data(), static_cast<ptrdiff_t>(at < in.start.size() ? in.start[at] : at));
  }
  void text(const std::vector<Unit>& got, LXShiftState state = 0) {
    EXPECT_EQ(testing::PrintToString(got), testing::PrintToString(units(c.expected.text(), state)));
  }
  /// What was written is the expected text, with a null or without, and how much the function says it is.
  void expect_output(const std::vector<Unit>& out, int32_t result, bool null_too = false) {
    auto text = units(c.expected.text(), states.output);
    if (null_too) text.push_back(0);
    EXPECT_EQ(testing::PrintToString(out), testing::PrintToString(text));
    EXPECT_EQ(result, c.expected.number("returns", count_of(text)));
  }
  /// What `put` writes into a buffer of this size.
  template <class Put>
  std::vector<Unit> output(int32_t size, int32_t* result, Put put) {
    return put_into<Unit>(size, flags, result, put);
  }
};

/// A family, in the forms that it has.
struct Family {
  void (*plain)(CaseRun<Plain>&);
  void (*ex)(CaseRun<Ex>&);
  void (*wide)(CaseRun<Wide>&);
  void (*unicode)(CaseRun<Unicode>&);
};
using Families = std::map<std::string, Family>;
template <class Body>
Family in_four_forms(Body body) {
  return {body, body, body, body};
}
template <class Body>
Family in_bytes(Body body) {
  return {body, body, nullptr, nullptr};
}

Families string_families();
Families compare_families();
Families convert_families();
Families walk_families();
Families format_families();
Families stream_families();
Families item_families();

}  // namespace lx::test
