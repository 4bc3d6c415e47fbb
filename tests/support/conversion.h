// What conversion gives: a character in the units of a form, as a small codepage has it; and an open conversion
// that is called with buffers of their exact sizes.
#pragma once

#include <gtest/gtest.h>

#include <string>
#include <type_traits>
#include <vector>

#include "lx.h"
#include "support/forms.h"
#include "support/tiny_codepages.h"

namespace lx::test {

/// A character of a codepage, or its substitution byte.
template <class F>
std::vector<typename F::Unit> units_of(const TinyCodepage& cp, LXUChar u) {
  if constexpr (std::is_same_v<F, Unicode>) {
    return {u};
  } else if constexpr (std::is_same_v<F, Wide>) {
    LXWChar code = 0;
    for (char byte : cp.encode({u})) code = code << 8 | static_cast<uint8_t>(byte);
    return {code};
  } else {
    const std::string bytes = cp.encode({u});
    return {bytes.begin(), bytes.end()};
  }
}
template <class F>
std::vector<typename F::Unit> units_of(const TinyCodepage& cp, const Units& text) {
  std::vector<typename F::Unit> all;
  for (LXUChar u : text)
    for (auto unit : units_of<F>(cp, u)) all.push_back(unit);
  return all;
}

class Conversion {
 public:
  Conversion(LXLocale* target, LXLocale* source) : handle_(LXOpenConversion(target, source)), target_(target) {}
  ~Conversion() { EXPECT_EQ(LXCloseConversion(handle_), LX_OK); }
  Conversion(const Conversion&) = delete;
  Conversion& operator=(const Conversion&) = delete;

  struct Step {
    int32_t code;
    std::string output;
    size_t taken;  // of the input
  };
  Step call(const std::string& input, int32_t room) {
    std::vector<char> in(input.begin(), input.end());
    std::vector<char> out(static_cast<size_t>(room));
    in.reserve(1);  // never a null pointer
    out.reserve(1);
    const char* in_at = in.data();
    char* out_at = out.data();
    int32_t in_left = static_cast<int32_t>(in.size());
    int32_t out_left = room;
    const int32_t code = LXConvertBuffer(handle_, &out_at, &out_left, &in_at, &in_left);
    EXPECT_EQ(LXGetError(target_), code);
    EXPECT_EQ(out_at - out.data(), room - out_left) << "pointer and rest move together";
    EXPECT_EQ(in_at - in.data(), static_cast<ptrdiff_t>(in.size()) - in_left);
    return {code, std::string(out.data(), static_cast<size_t>(out_at - out.data())),
            in.size() - static_cast<size_t>(in_left)};
  }

 private:
  LXConversion* handle_;
  LXLocale* target_;
};

}  // namespace lx::test
