// The trace: every message of the core and of locale handles with its level, the events of a call, and silence
// when the trace is off.
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <regex>

#include "core/library_fixture.h"
#include "core/lxformat.h"
#include "core/small_codepages.h"

namespace lx::test {
namespace {

constexpr uint32_t kAllLevels = RAS1_LEVEL_PROCESS | RAS1_LEVEL_ERRORS | RAS1_LEVEL_EVENTS | RAS1_LEVEL_DETAIL |
                                RAS1_LEVEL_INPUT | RAS1_LEVEL_NOTICES;

class TraceTest : public LibraryTest {
 protected:
  /// `action` issues these messages, in this order, at this level and only there.
  void expect_messages(uint32_t level, const std::vector<std::string>& expected,
                       const std::function<void()>& action) {
    SCOPED_TRACE(expected.front());
    const std::vector<std::string> texts = messages(level, action);
    auto at = texts.begin();
    for (const std::string& text : expected) {
      const auto found = std::find(at, texts.end(), text);
      ASSERT_NE(found, texts.end()) << "no message " << text << " among " << ::testing::PrintToString(texts);
      at = found + 1;
    }
    const std::vector<std::string> others = messages(kAllLevels & ~level, action);
    for (const std::string& text : expected)
      EXPECT_EQ(std::count(others.begin(), others.end(), text), 0) << text << " at another level";
  }

  /// Initialises on the directory, runs `action`, terminates.
  std::function<void()> in_library(
      std::function<void()> action = [] {}, uint32_t options = 0) {
    return [this, action, options] {
      init(directory.path().c_str(), options);
      action();
      hooks.fail_at(0);
      terminate();
    };
  }
  void expect_error_at_allocation(size_t n, const std::vector<std::string>& expected) {
    expect_messages(RAS1_LEVEL_ERRORS, expected, [&] {
      hooks.fail_at(n);
      in_library()();
    });
  }
  static std::string bytes(size_t count) { return std::to_string(count); }
  void write_table() {
    directory.write("control.nls", control_file({{1, LX_LANGUAGE, "English"},
                                                 {840, LX_TERRITORY, "UnitedStates"},
                                                 {367, LX_CODEPAGE, "US-ASCII"}}));
  }
  static int32_t ignored;
};
int32_t TraceTest::ignored;

TEST_F(TraceTest, Initialisation) {
  const std::string path = directory.path();
  write_table();
  expect_messages(RAS1_LEVEL_DETAIL,
                  {"Creating global area", "Lexicor init count = 0", "Lexicor init count = 2"},
                  in_library([this] { init(); }));
  expect_error_at_allocation(1, {"Unable to allocate " + bytes(sizeof(lx::GlobalArea)) + " bytes for globals"});
  expect_error_at_allocation(
      2, {"Unable to allocate " + bytes(sizeof(LXObjManager)) + " bytes for object manager"});
  expect_messages(RAS1_LEVEL_INPUT, {"directory = " + path + ".", "options = 7"}, in_library([] {}, 7));
  expect_messages(RAS1_LEVEL_INPUT, {"options = -2147483647"}, in_library([] {}, LX_NO_DEFAULTS));
  setenv("LX_LOCALEDIR", path.c_str(), 1);
  expect_messages(RAS1_LEVEL_INPUT, {"No directory specified", "options = 0"}, [&] {
    init(nullptr);
    terminate();
  });
}

TEST_F(TraceTest, ControlFile) {
  const std::string control = directory.file("control.nls");
  const std::string long_path(250, 'x');
  if (access(kDefaultControl, F_OK) == 0) GTEST_SKIP();
  expect_messages(RAS1_LEVEL_ERRORS,
                  {"Unable to construct control file name in directory " + long_path, "control size = 256",
                   "Unable to open control file"},
                  [&] {
                    init(long_path.c_str());
                    terminate();
                  });
  expect_messages(RAS1_LEVEL_INPUT, {"Opening file " + control}, in_library());
  expect_messages(RAS1_LEVEL_ERRORS,
                  {"Unable to open " + control + ", err = 1000", "Unable to open control file"}, in_library());

  write_table();
  expect_messages(RAS1_LEVEL_DETAIL,
                  {"LXObjDisk size = 38", "Entry = 0, Object Type = 0, Object Id = 1, Object Name = English",
                   "Entry = 1, Object Type = 1, Object Id = 840, Object Name = UnitedStates",
                   "Entry = 2, Object Type = 2, Object Id = 367, Object Name = US-ASCII"},
                  in_library());
  expect_messages(RAS1_LEVEL_ERRORS,
                  {"Open of " + directory.file("alias.txt") + " failed, err = 1000",
                   "Alias list build failed. No aliases supported"},
                  in_library());
  // Area, manager, file, header; then the raw records.
  expect_error_at_allocation(5, {"Unable to allocate 114 bytes for control data"});
  const ByteString whole = directory.read("control.nls");
  ByteString content = whole;
  content[0] = 0;
  directory.write("control.nls", content);
  expect_messages(RAS1_LEVEL_ERRORS, {"Control file header is corrupted"}, in_library());

  // The file's address stands in the next two.
  const auto expect_error = [&](const std::string& pattern) {
    directory.write("control.nls", content);
    const std::vector<std::string> texts = messages(RAS1_LEVEL_ERRORS, in_library());
    const auto matches = [&](const std::string& text) { return std::regex_match(text, std::regex(pattern)); };
    EXPECT_TRUE(std::any_of(texts.begin(), texts.end(), matches)) << pattern;
  };
  content = whole;
  put_le32(content.data() + format::header_section_offset(0), 0xFFFFFFFE);
  expect_error("Seek to offset -2 failed for file 0x.+");
  content = whole;
  content.pop_back();
  expect_error("Read of 114 bytes from file 0x.+ failed with error 1003");
}

TEST_F(TraceTest, Aliases) {
  write_table();
  const std::string failed = "Alias list build failed. No aliases supported";
  const auto expect_alias_messages = [&](const std::string& text, uint32_t level,
                                         const std::vector<std::string>& expected) {
    directory.write_text("alias.txt", text);
    expect_messages(level, expected, in_library());
  };
  expect_alias_messages(
      "UTF-8 utf8\n", RAS1_LEVEL_DETAIL,
      {"Processing codepage 'UTF-8'", "Processing alias 'utf8'", "Saved alias UTF8, length = 4"});
  const std::string name(33, 'n');
  const std::string alias(65, 'a');
  expect_alias_messages(" one\n", RAS1_LEVEL_ERRORS, {"Codepage name one does not start in column 1", failed});
  expect_alias_messages(name + "\n", RAS1_LEVEL_ERRORS,
                        {"codepage name length (33) for " + name + " exceeds maximum of 32", failed});
  // The limit applied is 64; readers of the message know the limit of codepage names.
  expect_alias_messages("A " + alias + "\n", RAS1_LEVEL_ERRORS,
                        {"Alias name length (65) for " + alias + " exceeds maximum of 32", failed});
  directory.write_text("alias.txt", "A one\n");
  init();
  const size_t calls = hooks.calls();
  terminate();
  expect_error_at_allocation(
      calls,
      {"Unable to allocate " + bytes(sizeof(lx::AliasRecord)) + " bytes for codepage A, alias one", failed});
  expect_messages(RAS1_LEVEL_INPUT, {"Searching for One."},
                  in_library([] { LXGetCodepageFromAlias(nullptr, "One"); }));
  expect_messages(RAS1_LEVEL_NOTICES, {"One -> A"}, in_library([] { LXGetCodepageFromAlias(nullptr, "One"); }));
}

TEST_F(TraceTest, Files) {
  init();
  const std::string path = directory.file("data.nls");
  const std::string temporary = directory.file("datatmp");
  directory.write_text("data.nls", "text");
  const auto rewrite = [&] { LXCloseFile(LXOpenFile(0, path.c_str(), LX_WRITE, 0, &ignored), 0); };
  expect_messages(RAS1_LEVEL_INPUT, {"Opening file " + path}, rewrite);
  expect_messages(RAS1_LEVEL_DETAIL, {"Using temp file " + temporary, "Renaming " + temporary + " to " + path},
                  rewrite);
  expect_messages(RAS1_LEVEL_ERRORS, {"Close failed, rc = 2"}, [&] {
    directory.write_text("data.nls", "text");
    LXFile* file = LXOpenFile(0, path.c_str(), LX_WRITE, 0, &ignored);
    std::filesystem::remove(path);
    EXPECT_EQ(LXCloseFile(file, 0), 0) << "the result is the close's";
    EXPECT_FALSE(directory.exists("data.nls"));
  });
  expect_messages(RAS1_LEVEL_DETAIL,
                  {"Original path: a:/d/name.ext\n drive: a:\n directory: /d/\n file: name\n extent: .ext"},
                  [] {
                    char drive[4], directory_part[256], file[15], extension[5];
                    SplitPath("a:/d/name.ext", drive, directory_part, file, extension);
                  });
}

TEST_F(TraceTest, LookUpsAndLocales) {
  directory.write_locale({{367, "US-ASCII", ascii_codepage()}});
  const char* const cases[][2] = {{"X", "Unable to locate language, rc = 37"},
                                  {"English_X", "Unable to locate territory, rc = 37"},
                                  {"English.X", "Unable to locate code page, rc = 37"},
                                  {"English@X", "Unable to locate sort, rc = 37"}};
  for (const auto& c : cases)
    expect_messages(RAS1_LEVEL_ERRORS, {c[1]}, in_library([&c] { LXGetLocale(c[0], 0, nullptr); }));
  expect_messages(RAS1_LEVEL_INPUT,
                  {"Searching for type 2, name US-ASCII", "Searching for type 0, name English"}, in_library([] {
                    LXGetObjFromName(nullptr, LX_CODEPAGE, "US-ASCII@x", 8, LX_FIND_ONLY, &ignored);
                    const LXWChar name[] = {'E', 'n', 'g', 'l', 'i', 's', 'h', 0};
                    LXGetObjFromNameW(nullptr, LX_LANGUAGE, name, 8, LX_FIND_ONLY, &ignored);
                  }));
}

TEST_F(TraceTest, Events) {
  directory.write_locale({{367, "US-ASCII", ascii_codepage()}});
  char drive[4], directory_part[256], file[15], extension[5];
  RecordingTrace::set_level(RAS1_LEVEL_EVENTS);
  init();
  LXGetObjFromName(nullptr, LX_LANGUAGE, "X", 1, 0, &ignored);
  const auto entry = reinterpret_cast<intptr_t>(LXGetObjFromID(nullptr, LX_CODEPAGE, 367, 0, &ignored));
  LXSetLocale("X", 0);
  LXGetLocale("X", 0, nullptr);
  LXLocale* const locale = LXGetLocale("English", 0, nullptr);
  LXConvertLocale(locale, file, 0);
  LXReleaseLocale(locale);
  SplitPath("/d/name.ext", drive, directory_part, file, extension);
  LXTerm();
  LXTerm();
  RecordingTrace::set_level(0);
  std::vector<intptr_t> values;  // of the calls from outside; -1 is an exit without one
  int depth = 0;
  for (const TraceRecord& record : RecordingTrace::take()) {
    EXPECT_NE(record.kind, TraceRecord::kMessage) << record.text;
    EXPECT_FALSE(record.unit.empty());
    EXPECT_GT(record.line, 0);
    depth += record.kind == TraceRecord::kEntry ? 1 : -1;
    ASSERT_GE(depth, 0);
    if (depth == 0) values.push_back(record.kind == TraceRecord::kExitValue ? record.value : -1);
  }
  EXPECT_EQ(depth, 0) << "each entry has its exit";
  EXPECT_EQ(values,
            (std::vector<intptr_t>{LX_OK, 0, entry, LX_E_NO_LANGUAGE, 0, reinterpret_cast<intptr_t>(locale), 1,
                                   0, -1, LX_OK, LX_E_NOT_INITIALIZED}));
  in_library([] { LXSetLocale("X", 0); })();
  EXPECT_TRUE(RecordingTrace::take().empty()) << "the trace is off";
}

}  // namespace
}  // namespace lx::test
