// Faults of files: the files of a locale directory cut and changed, in every byte where records stand and in a
// part of those of their long tables. Each fault gives a documented code or is harmless, and nothing is left
// behind. Most errors show under the sanitizers.
#include <cstring>
#include <filesystem>
#include <fstream>
#include <memory>
#include <set>

#include "core/library_fixture.h"
#include "core/lxformat.h"
#include "core/small_codepages.h"
#include "support/tiny_codepages.h"

namespace lx::test {
namespace {

constexpr char kName[] = "English_UnitedStates.Under test@BINARY";
constexpr uint16_t kTestedId = 900;

/// A copy in a block of exactly its size, so that a sanitizer sees a byte read behind it.
struct ExactText {
  explicit ExactText(const std::string& text)
      : bytes(static_cast<int32_t>(text.size())), data(new char[text.size()]) {
    memcpy(data.get(), text.data(), text.size());
  }
  const char* end() const { return data.get() + bytes; }
  int32_t bytes;
  std::unique_ptr<char[]> data;
};

std::string all_bytes() {
  std::string text;
  for (int round = 0; round < 2; ++round)
    for (int b = 0; b < 256; ++b) text.push_back(static_cast<char>(round == 0 ? b : 255 - b));
  return text;
}

/// Walks and converts a text that ends anywhere, in every form.
void use_text(LXLocale* locale, const std::string& text) {
  const ExactText exact(text);
  const char* const data = exact.data.get();
  LXUChar unicode[1100];
  LXWChar codes[1100];
  char bytes[5200];
  LXShiftState end_state = LX_SHIFT_SINGLE;
  EXPECT_LE(LXMoveStringPointer(locale, data, exact.bytes, 0), exact.end());
  const int32_t units = LXStringToUnicode(unicode, 1100, locale, data, exact.bytes, 0);
  ASSERT_GE(units, 0);
  EXPECT_LE(units, exact.bytes);
  const int32_t wide = LXMbToWide(locale, codes, 1100, data, exact.bytes, 0);
  EXPECT_EQ(wide, LXNumChars(locale, data, exact.bytes));
  EXPECT_GE(LXWideToMb(locale, bytes, sizeof(bytes), codes, wide, 0), 0);
  for (LXShiftState state : {LX_SHIFT_SINGLE, LX_SHIFT_DOUBLE}) {
    EXPECT_LE(LXMoveStringPointerEx(locale, data, state, exact.bytes, &end_state, 0), exact.end());
    EXPECT_GE(LXStringToUnicodeEx(unicode, 1100, locale, data, state, exact.bytes, 0), 0);
    EXPECT_GE(LXMbToWideEx(locale, codes, 1100, data, state, exact.bytes, 0), 0);
    EXPECT_GE(LXUnicodeToStringEx(locale, bytes, state, sizeof(bytes), unicode, units, LX_TERMINATE), 0);
    EXPECT_GE(LXConvertStringEx(locale, bytes, state, 300, locale, data, state, exact.bytes, LX_TERMINATE), 0);
  }
}

void use_stream(LXLocale* locale, const std::string& text) {
  LXConversion* conversion = LXOpenConversion(locale, locale);
  ASSERT_NE(conversion, nullptr);
  size_t at = 0;
  for (int steps = 0; at < text.size(); ++steps) {
    ASSERT_LT(steps, 5000) << "the stream stands still";
    const ExactText piece(text.substr(at, 5));
    const char* input = piece.data.get();
    char out[8];
    char* output = out;
    int32_t input_left = piece.bytes, output_left = sizeof(out);
    LXConvertBuffer(conversion, &output, &output_left, &input, &input_left);
    at += static_cast<size_t>(piece.bytes - input_left);
  }
  EXPECT_EQ(LXCloseConversion(conversion), 0);
}

/// Everything that a codepage's tables answer, for every first byte and a sample of every Unicode page.
void use_locale(LXLocale* locale, bool thorough) {
  const std::string text = all_bytes();
  // With what follows cut at every length that a character may have.
  for (size_t cut = 0; cut < (thorough ? 4u : 1u); ++cut) use_text(locale, text.substr(0, text.size() - cut));
  use_stream(locale, text);
  for (int first = 1; first < 256; ++first) {
    const std::string start(1, static_cast<char>(first));
    // The last character of a text, as long as its first byte or its state says.
    for (const char* second : {"\x40", "\x42", "\xFF"}) {
      const std::string character = start + std::string(3, *second);
      const int32_t length = LXByteLength(locale, character.c_str());
      ASSERT_GE(length, 1);
      ASSERT_LE(length, 4);
      const ExactText last(character.substr(0, static_cast<size_t>(length)));
      LXGetCharType(locale, last.data.get(), LX_CTYPE1);
      LXUChar unit;
      EXPECT_LE(LXStringToUnicode(&unit, 1, locale, last.data.get(), last.bytes, 0), 1);
      LXGetCharTypeW(locale, LXGetChar(locale, last.data.get()), LX_CTYPE1);
      LXGetCharTypeW(locale, static_cast<LXWChar>(first << 8 | static_cast<unsigned char>(*second)), LX_CTYPE2);
      const std::string wide =
          start + character.substr(0, locale->codepage->section[0][format::codepage::kWidth]);
      const ExactText shifted(wide.substr(0, wide.size() - 1));
      EXPECT_GE(LXStringToUnicodeEx(&unit, 1, locale, shifted.data.get(), 1, shifted.bytes, 0), 0);
    }
  }
  LXUChar units[512];
  for (int i = 0; i < 512; ++i)
    units[i] = static_cast<LXUChar>(i / 2 << 8 | (i % 2 == 0 ? i * 7 & 0xFF : 0x40 + i % 8));
  char bytes[5 * 512 + 8];
  LXWChar codes[512];
  EXPECT_GE(LXUnicodeToString(locale, bytes, sizeof(bytes), units, 512, 0), 0);
  EXPECT_EQ(LXUnicodeToStringW(locale, codes, 512, units, 512, 0), 512);
}

class FaultTest : public LibraryTest {
 protected:
  void write_directory(const std::vector<ByteString>& tested = tiny_shift_jis().file.sections,
                       uint16_t id = kTestedId) {
    directory.write_locale(
        {{id, "Under test", tested}, {static_cast<uint16_t>(id + 1), "Old", version1_ascii_codepage(), 1}});
    directory.write_text("alias.txt", "Under test one two\nOld three\n");
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
      // The built-in codepage is sound, whatever the file was.
      if ((locale->codepage->disk.flags & kObjectBuiltIn) == 0) use_locale(locale, false);
      EXPECT_EQ(LXReleaseLocale(locale), 0);
    }
    locale = LXGetLocale("", LX_FALLBACK, &rc);
    if (locale != nullptr) LXReleaseLocale(locale);
    EXPECT_EQ(LXTerm(), LX_OK);
    EXPECT_EQ(hooks.live_blocks(), 0u);
  }

  /// Whether a fault is made at this byte: in all of a file's beginning and end, and in every 17th byte of the
  /// long tables between, which so are met at every place of their records. `turn_` picks others each time.
  bool is_tested(size_t at, size_t file_bytes) const {
    constexpr size_t kBeginning = format::kHeaderBytes + 128, kEnd = 64;
    return at < kBeginning || at + kEnd >= file_bytes || at % 17 == turn_;
  }

  void cut_everywhere(const std::string& file, bool refused) {
    const std::string path = directory.file(file);
    const ByteString content = directory.read(file);
    size_t whole = content.size();
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
      std::filesystem::resize_file(path, bytes);
      if (refused) {
        ASSERT_EQ(init(directory.path().c_str(), LX_NO_DEFAULTS),
                  file == "control.nls" ? LX_W_DEFAULTS : LX_OK);
        EXPECT_EQ(LXGetLocale(kName, 0, nullptr), nullptr);
        EXPECT_EQ(LXTerm(), LX_OK);
        EXPECT_EQ(hooks.live_blocks(), 0u);
      } else {
        use_damaged_directory();
      }
      ASSERT_FALSE(HasFailure());
    }
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
        if (value == whole[at]) continue;
        SCOPED_TRACE(file + " with " + std::to_string(value) + " at " + std::to_string(at));
        put(at, value);
        use_damaged_directory();
        ASSERT_FALSE(HasFailure());
      }
      put(at, whole[at]);
    }
  }

  /// Changes one file in every way, and uses what can still be used.
  void sweep(const std::string& file, bool refused_when_cut) {
    const ByteString whole = directory.read(file);
    ASSERT_FALSE(whole.empty());
    ASSERT_NO_FATAL_FAILURE(cut_everywhere(file, refused_when_cut));
    directory.write(file, whole);
    ASSERT_NO_FATAL_FAILURE(change_everywhere(file));
    ASSERT_EQ(init(), LX_OK);
    LXLocale* locale = LXGetLocale(kName, 0, nullptr);
    ASSERT_NE(locale, nullptr) << "the file is sound when nothing is changed";
    EXPECT_EQ(locale->codepage->disk.flags, 0);
    use_locale(locale, true);
    EXPECT_EQ(LXReleaseLocale(locale), 0);
    EXPECT_EQ(LXTerm(), LX_OK);
    turn_ = (turn_ + 5) % 17;
  }

 private:
  size_t turn_ = 0;
};

TEST_F(FaultTest, FilesCutAndChangedAnywhere) {
  for (const char* file : {"control.nls", "alias.txt", "la_00001.nls", "te_00840.nls"}) {
    write_directory();
    ASSERT_NO_FATAL_FAILURE(sweep(file, file != std::string("alias.txt")));
  }
  for (const auto& codepage : {ascii_codepage(), tiny_shift_jis().file.sections, tiny_shift().file.sections}) {
    write_directory(codepage);
    ASSERT_NO_FATAL_FAILURE(sweep("cp_00900.nls", true));
  }
  write_directory();
  directory.write("cp_00900.nls", object_file(version1_ascii_codepage(), 1));
  cut_everywhere("cp_00900.nls", true);
}

TEST_F(FaultTest, ComputedUtf8HasNoShiftState) {
  std::vector<ByteString> sections = tiny_utf8().file.sections;
  for (int32_t code : {LX_OK, LX_E_CORRUPT}) {
    write_directory(sections, format::codepage::kUtf8Id);
    ASSERT_EQ(init(directory.path().c_str(), LX_NO_DEFAULTS), LX_OK);
    int32_t rc = -1;
    LXGetObjFromID(nullptr, LX_CODEPAGE, format::codepage::kUtf8Id, LX_FIND_AND_LOAD, &rc);
    EXPECT_EQ(rc, code);
    EXPECT_EQ(LXTerm(), LX_OK);
    sections[0][format::codepage::kFlags] |= format::codepage::kFlagShift;
  }
}

}  // namespace
}  // namespace lx::test
