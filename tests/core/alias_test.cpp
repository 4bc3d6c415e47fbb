// Codepage aliases: look-ups, and whose they are. The alias file's lines stand in tests/cases/cli/aliases.txt.
#include "core/library_fixture.h"

namespace lx::test {
namespace {

class AliasTest : public LibraryTest {
 protected:
  void load(const std::string& text) {
    directory.write("control.nls", control_file({{1, LX_LANGUAGE, "English"}}));
    directory.write_text("alias.txt", text);
    ASSERT_EQ(init(), LX_OK);
  }
};

TEST_F(AliasTest, LookUpAndEnumeration) {
  load("UTF-8 utf8\nIBM-850 850 Latin-1\nIBM-437 latin-1 437\n");
  EXPECT_STREQ(LXGetCodepageFromAlias(nullptr, "Utf8"), "UTF-8");
  EXPECT_STREQ(LXGetCodepageFromAlias(nullptr, "437"), "IBM-437");
  EXPECT_STREQ(LXGetCodepageFromAlias(nullptr, "LATIN-1"), "IBM-850") << "the first in file order";
  for (const char* unknown : {"", "UTF", "UTF88", "UTF-8", "IBM-850"})
    EXPECT_EQ(LXGetCodepageFromAlias(nullptr, unknown), nullptr) << unknown;
  int calls = 0;
  const auto two = [](void* user, const char*, const char*) { return ++*static_cast<int*>(user) < 2 ? 1 : 0; };
  EXPECT_EQ(LXEnumAliases(nullptr, two, &calls), LX_OK);
  EXPECT_EQ(calls, 2);
}

TEST_F(AliasTest, EachManagerHasItsOwn) {
  ScratchDirectory other;
  other.write("control.nls", control_file({{1, LX_LANGUAGE, "Other"}}));
  other.write_text("alias.txt", "B one\n");
  load("A one\n");
  int32_t rc = -1;
  LXObjManager* own = LXInitObjManager(other.path().c_str(), 0, &rc);
  EXPECT_EQ(rc, LX_OK);
  ASSERT_NE(own, nullptr);
  EXPECT_STREQ(LXGetCodepageFromAlias(own, "ONE"), "B");
  EXPECT_STREQ(LXGetCodepageFromAlias(nullptr, "ONE"), "A");
  EXPECT_STREQ(LXGetObjFromID(own, LX_LANGUAGE, 1, LX_FIND_ONLY, &rc)->disk.name, "Other");
  EXPECT_STREQ(LXGetObjFromID(nullptr, LX_LANGUAGE, 1, LX_FIND_ONLY, &rc)->disk.name, "English");
  EXPECT_EQ(LXTermObjManager(own), LX_OK);
  EXPECT_EQ(LXTermObjManager(nullptr), LX_E_INVALID);
}

}  // namespace
}  // namespace lx::test
