// Faults of files: the files of a locale directory cut and changed, in every byte where records stand and in a
// part of those of their long tables. Each fault gives a documented code or is harmless, and nothing is left
// behind. Most errors show under the sanitizers. What a codepage's own tables may hold is tested beside them.
#include <algorithm>
#include <cstring>
#include <set>

#include "core/library_fixture.h"
#include "support/damage.h"
#include "support/tiny_codepages.h"

namespace lx::test {
namespace {

constexpr char kName[] = "English_UnitedStates.Under test@BINARY";

class FaultTest : public LibraryTest {
 protected:
  void write_directory(const ScratchDirectory::Codepage& tested) {
    directory.write_locale({tested, {901, "Other", ascii_codepage()}});
    directory.write_text("alias.txt", "Under test one two\nOther three\n");
  }

  void use_damaged_directory() {
    const int32_t code = init();
    ASSERT_TRUE(code == LX_OK || code == LX_W_DEFAULTS) << code;
    LXEnumLocales([](void*, int32_t, const char* name) { return strlen(name) <= 33 ? 1 : 0; }, nullptr);
    LXGetCodepageFromAlias(nullptr, "TWO");
    int32_t rc = -1;
    LXLocale* locale = LXGetLocale(kName, 0, &rc);
    static const std::set<int32_t> documented = {
        LX_OK, LX_E_NOT_INITIALIZED, LX_E_NO_LANGUAGE, LX_E_NO_CODEPAGE, LX_E_NO_TERRITORY, LX_E_NO_SORT};
    EXPECT_EQ(documented.count(rc), 1u) << rc;
    EXPECT_EQ(locale != nullptr, rc == LX_OK);
    if (locale != nullptr) {
      EXPECT_LE(LXNumChars(locale, "text", 4), 4);
      EXPECT_EQ(LXReleaseLocale(locale), 0);
    }
    LXReleaseLocale(LXGetLocale("", LX_FALLBACK, &rc));
    EXPECT_EQ(LXTerm(), LX_OK);
    EXPECT_EQ(hooks.live_blocks(), 0u);
  }
  /// Whether a fault is made at this byte: in all of a file's beginning and end, and in every 29th byte of the
  /// long tables between, which so are met at every place of their records.
  static bool is_tested(size_t at, size_t file_bytes) {
    constexpr size_t kBeginning = format::kHeaderBytes + 128, kEnd = 64;
    return at < kBeginning || at + kEnd >= file_bytes || at % 29 == 0;
  }

  /// Uses the directory with each fault of a file, then with the sound file.
  void damage(const std::string& file) {
    const ByteString whole = directory.read(file);
    for_each_damage(whole, [&](const ByteString& damaged) {
      const auto at = static_cast<size_t>(std::mismatch(damaged.begin(), damaged.end(), whole.begin()).first -
                                          damaged.begin());
      if (at == whole.size() || !is_tested(at, whole.size()) || HasFailure()) return;
      SCOPED_TRACE(file + " damaged at " + std::to_string(at));
      directory.write(file, damaged);
      use_damaged_directory();
    });
    directory.write(file, whole);
    ASSERT_EQ(init(), LX_OK);
    LXLocale* locale = LXGetLocale(kName, 0, nullptr);
    ASSERT_NE(locale, nullptr) << "the file is sound when nothing is changed";
    EXPECT_EQ(locale->codepage->disk.flags & kObjectBuiltIn, 0);
    EXPECT_EQ(LXReleaseLocale(locale), 0);
    EXPECT_EQ(LXTerm(), LX_OK);
  }
};

TEST_F(FaultTest, FilesCutAndChangedAnywhere) {
  write_directory({900, "Under test", tiny_shift_jis().file.sections});
  for (const char* file : {"control.nls", "alias.txt", "la_00001.nls", "te_00840.nls", "cp_00900.nls"})
    ASSERT_NO_FATAL_FAILURE(damage(file));
  // A codepage that is converted.
  write_directory({900, "Under test", version1_codepage(ascii_codepage()), 1});
  damage("cp_00900.nls");
}

}  // namespace
}  // namespace lx::test
