// What tests of texts start from: the library on small codepages of every kind, random numbers, and the forms.
#pragma once

#include <gtest/gtest.h>

#include <random>

#include "support/case_library.h"
#include "support/encoded_text.h"

namespace lx::test {

class CaseTest : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library.close()); }

  size_t below(size_t n) { return random() % n; }
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
