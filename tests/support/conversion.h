// What conversion and mapping give: a model of an output of any size; and an open conversion that is called with
// buffers of their exact sizes.
#pragma once

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "lx.h"

namespace lx::test {

/// What a conversion should give: pieces of output, one a character, in order.
template <class Unit>
struct OutputModel {
  std::vector<std::vector<Unit>> pieces;
  bool cut = false;              // the input ends inside a character
  bool null_terminated = false;  // the length is given as -1
  bool null_converted = false;   // ... and its null is one of the characters

  std::vector<Unit> output(int32_t size, int32_t flags, int32_t* result) const {
    std::vector<Unit> out;
    *result = 0;
    const bool terminate = (flags & LX_TERMINATE) != 0;
    if (size <= 0 || (pieces.empty() && !cut && !null_terminated && !terminate)) return out;
    const bool chars = (flags & LX_CHARACTERS) != 0 && sizeof(Unit) == 1;
    const size_t limit = static_cast<size_t>(size) - terminate;
    size_t used = 0, taken = 0;
    for (const auto& piece : pieces) {
      const size_t grown = used + (chars ? 1 : piece.size());
      if (grown > limit) break;
      used = grown;
      ++taken;
      out.insert(out.end(), piece.begin(), piece.end());
    }
    const bool all = taken == pieces.size() && !cut;
    if (terminate || (!null_converted && null_terminated && all && used < limit)) {
      out.push_back(0);
      ++used;
    }
    *result = static_cast<int32_t>(used);
    return out;
  }
};

/// Calls a conversion for every size up to two more than it can use, and compares result, output and canaries.
template <class Unit, class Call>
void expect_at_every_size(const OutputModel<Unit>& model, int32_t flags, const Call& convert) {
  size_t needed = 1;
  for (const auto& piece : model.pieces) needed += piece.size();
  const Unit canary = static_cast<Unit>(0xA5A5A5A5);
  for (int32_t size = 0; size <= static_cast<int32_t>(needed) + 2; ++size) {
    int32_t result = 0;
    std::vector<Unit> expected = model.output(size, flags, &result);
    std::vector<Unit> output(needed + 4, canary);
    expected.resize(output.size(), canary);
    EXPECT_EQ(convert(output.data(), size, flags), result) << "size " << size << " flags " << flags;
    EXPECT_EQ(output, expected) << "size " << size << " flags " << flags;
  }
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
