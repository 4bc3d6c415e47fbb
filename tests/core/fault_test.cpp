// Faults of files: the files of a locale directory cut and changed, in every byte where records stand and in a
// part of those of their long tables. Each fault gives a documented code or is harmless, and nothing is left
// behind. Most errors show under the sanitizers. What a codepage's own tables may hold is tested beside them.
#include <cstring>
#include <filesystem>
#include <fstream>
#include <set>

#include "core/library_fixture.h"
#include "core/lxformat.h"
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
    locale = LXGetLocale("", LX_FALLBACK, &rc);
    if (locale != nullptr) LXReleaseLocale(locale);
    EXPECT_EQ(LXTerm(), LX_OK);
    EXPECT_EQ(hooks.live_blocks(), 0u);
  }
  void expect_refused(int32_t code) {
    ASSERT_EQ(init(directory.path().c_str(), LX_NO_DEFAULTS), code);
    EXPECT_EQ(LXGetLocale(kName, 0, nullptr), nullptr);
    EXPECT_EQ(LXTerm(), LX_OK);
    EXPECT_EQ(hooks.live_blocks(), 0u);
  }

  /// Whether a fault is made at this byte: in all of a file's beginning and end, and in every 17th byte of the
  /// long tables between, which so are met at every place of their records.
  static bool is_tested(size_t at, size_t file_bytes) {
    constexpr size_t kBeginning = format::kHeaderBytes + 128, kEnd = 64;
    return at < kBeginning || at + kEnd >= file_bytes || at % 17 == 0;
  }

  void cut_everywhere(const std::string& file) {
    const ByteString content = directory.read(file);
    size_t whole = content.size();
    const bool refused = file != "alias.txt";
    if (refused) {  // up to the end of the last section: what stands behind it is not read
      const auto header = format::Header::read(content.data());
      whole = 0;
      for (size_t n = 0; n < header.sections; ++n)
        if (header.section[n].bytes != 0)
          whole = std::max(whole, size_t{header.section[n].offset} + header.section[n].bytes);
    }
    for (size_t bytes = whole; bytes-- > 0;) {
      if (!is_tested(bytes, whole)) continue;
      SCOPED_TRACE(file + " cut to " + std::to_string(bytes));
      std::filesystem::resize_file(directory.file(file), bytes);
      refused ? expect_refused(file == "control.nls" ? LX_W_DEFAULTS : LX_OK) : use_damaged_directory();
      ASSERT_FALSE(HasFailure());
    }
    directory.write(file, content);
  }

  void change_everywhere(const std::string& file) {
    const ByteString whole = directory.read(file);
    std::fstream stream(directory.file(file), std::ios::binary | std::ios::in | std::ios::out);
    const auto put = [&](size_t at, uint8_t value) {
      stream.seekp(static_cast<std::streamoff>(at));
      stream.put(static_cast<char>(value)).flush();
    };
    for (size_t at = 0; at < whole.size(); ++at) {
      if (!is_tested(at, whole.size())) continue;
      const std::set<uint8_t> values = {static_cast<uint8_t>(whole[at] ^ 0x01), 0, 0xFF};
      for (uint8_t value : values) {
        SCOPED_TRACE(file + " with " + std::to_string(value) + " at " + std::to_string(at));
        put(at, value);
        use_damaged_directory();
        ASSERT_FALSE(HasFailure());
      }
      put(at, whole[at]);
    }
  }
};

TEST_F(FaultTest, FilesCutAndChangedAnywhere) {
  const ScratchDirectory::Codepage old{900, "Under test", version1_codepage(ascii_codepage()), 1};
  write_directory(old);
  ASSERT_NO_FATAL_FAILURE(cut_everywhere("cp_00900.nls"));
  write_directory({900, "Under test", tiny_shift_jis().file.sections});
  for (const char* file : {"control.nls", "alias.txt", "la_00001.nls", "te_00840.nls", "cp_00900.nls"}) {
    ASSERT_NO_FATAL_FAILURE(cut_everywhere(file));
    ASSERT_NO_FATAL_FAILURE(change_everywhere(file));
    ASSERT_EQ(init(), LX_OK);
    LXLocale* locale = LXGetLocale(kName, 0, nullptr);
    ASSERT_NE(locale, nullptr) << "the file is sound when nothing is changed";
    EXPECT_EQ(locale->codepage->disk.flags, 0);
    EXPECT_EQ(LXReleaseLocale(locale), 0);
    EXPECT_EQ(LXTerm(), LX_OK);
  }
}

}  // namespace
}  // namespace lx::test
