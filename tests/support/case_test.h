// What tests of texts start from: the library on small codepages of every kind, random numbers, and the forms.
#pragma once

#include <gtest/gtest.h>

#include <random>

#include "support/case_library.h"
#include "support/encoded_text.h"

namespace lx::test {

/// Gives `put` a buffer and its size in units, in bytes with LX_CHARACTERS, of which each character may take six,
/// and gives back what it wrote: so many units as it says, or in characters up to what is as it was. Nothing
/// behind them is touched.
template <class Unit, class Put>
std::vector<Unit> put_into(int32_t size, uint32_t flags, int32_t* result, Put put) {
  constexpr Unit kCanary = static_cast<Unit>(0xA5A5A5A5);
  const bool by_chars = sizeof(Unit) == 1 && (flags & LX_CHARACTERS) != 0;
  const size_t room = static_cast<size_t>(std::max(size, 0)) * (by_chars ? 6 : 1);
  std::vector<Unit> buffer(room + 4, kCanary);
  *result = put(buffer.data(), size);
  EXPECT_LE(*result, std::max(size, 0));
  size_t end = static_cast<size_t>(std::max(*result, 0));
  // Behind the result at most a character that was taken back, so that a shift state could be closed.
  const size_t behind = by_chars ? room : std::min(room, end + 3);
  EXPECT_EQ(std::vector<Unit>(buffer.begin() + static_cast<ptrdiff_t>(behind), buffer.end()),
            std::vector<Unit>(buffer.size() - behind, kCanary))
      << "behind the result " << *result << " of " << size;
  if (by_chars)
    for (end = room; end > 0 && buffer[end - 1] == kCanary;) --end;
  buffer.resize(end);
  return buffer;
}

/// What a call wrote in a locale, without the null that LX_TERMINATE asks for.
template <class F>
struct Written {
  Units text;
  Text<typename F::Unit> units;
  int32_t result, code;
};
template <class F, class Put>
Written<F> written(const F& form, LXLocale* in, int32_t size, uint32_t flags, Put put) {
  Written<F> made{};
  auto out = put_into<typename F::Unit>(size, flags, &made.result, put);
  made.code = LXGetError(in);
  if (made.result > 0 && (flags & LX_TERMINATE) != 0) {
    EXPECT_EQ(out.at(out.size() - 1), 0);
    out.pop_back();
  }
  made.units.assign(out.begin(), out.end());
  made.text = decode(form, in, made.units);
  return made;
}

/// The tokens of a text, which is changed, in a codepage; what is left counts down to 0 with the last one.
template <class F>
std::vector<Units> tokens_of(const F& form, const TinyCodepage& cp, LXLocale* in,
                             std::vector<typename F::Unit>& text, int32_t length,
                             const std::vector<typename F::Unit>& set, int32_t set_length, uint32_t flags) {
  using Unit = typename F::Unit;
  std::vector<Units> tokens;
  Unit* next = nullptr;
  states.result = 0;
  for (Unit* at = text.data(); at != nullptr; at = next) {
    const Unit* const token = form.tok(in, at, &length, set.data(), set_length, &next, flags);
    EXPECT_EQ(next == nullptr, length == 0);
    if (token == nullptr) break;
    const Unit* const end = text.data() + text.size();
    states.text = cp.shift ? states.token : 0;
    tokens.push_back(decode(form, in, Text<Unit>(token, std::find(token, end, Unit{0}))));
    states.text = 0;
  }
  return tokens;
}

class CaseTest : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library.close()); }

  size_t below(size_t n) { return random() % n; }
  int any(size_t end) { return static_cast<int>(below(end)); }
  template <class List>
  auto any_of(const List& list) {
    return list[below(std::size(list))];
  }
  Units any_text(const Units& letters, size_t most) {
    Units text(below(most + 1), 0);
    for (LXUChar& u : text) u = any_of(letters);
    return text;
  }
  /// Calls `body` with the forms that can have all characters of a codepage: the plain one knows no shift bytes.
  template <class Body>
  static void forms_of(const TinyCodepage& cp, const Body& body) {
    in_all_forms([&](const auto& form) {
      SCOPED_TRACE(cp.file.name + " " + form.name);
      if (form.name != kPlain.name || !cp.shift) body(form);
    });
  }

  CaseLibrary library;
  std::mt19937 random{1};
};

inline int sign(int64_t value) {
  return (value > 0) - (value < 0);
}

}  // namespace lx::test
