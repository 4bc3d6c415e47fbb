// What the core and locale handles say in the trace, and at which level.
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <regex>
#include <set>
#include <sstream>

#include "core/tiny_directory.h"
#include "support/case_rows.h"

namespace lx::test {
namespace {

const std::pair<const char*, uint32_t> kLevels[] = {
    {"process", RAS1_LEVEL_PROCESS}, {"error", RAS1_LEVEL_ERRORS}, {"detail", RAS1_LEVEL_DETAIL},
    {"input", RAS1_LEVEL_INPUT},     {"flow", RAS1_LEVEL_FLOW},    {"notice", RAS1_LEVEL_NOTICES}};

using Action = std::function<void()>;
const Action kNothing = [] {};

class TraceTest : public LibraryTest {
 protected:
  /// What is different on every machine and in every run gets a name.
  std::string named(std::string text) const {
    const auto allocation = [](size_t bytes) { return "allocate " + std::to_string(bytes) + " "; };
    const std::pair<std::string, const char*> names[] = {
        {directory.path(), "DIR"},
        {"0x[0-9a-f]+", "ADDRESS"},
        {"\n", "\\n"},
        {allocation(sizeof(GlobalArea)), "allocate AREA "},
        {allocation(sizeof(LXObjManager)), "allocate MANAGER "}};
    for (const auto& [what, name] : names) text = std::regex_replace(text, std::regex(what), name);
    return text;
  }

  /// The messages of `action` as "level: text" lines, one level after the other, without those that every use
  /// of the library gives.
  std::vector<std::string> transcript(const Action& action) {
    std::vector<std::string> lines;
    for (const auto& [name, level] : kLevels) {
      for (const std::string& text : messages(level, action)) {
        const std::string line = std::string(name) + ": " + named(text);
        if (usual_.count(line) == 0) lines.push_back(line);
      }
    }
    return lines;
  }

  /// A use of the library in which `action` happens.
  Action use(const Action& action = kNothing) {
    return [this, action] {
      init();
      action();
      hooks.fail_at(0);
      terminate();
    };
  }
  Action without_memory(size_t n) {
    return [this, n] {
      hooks.fail_at(n);
      use()();
    };
  }

  static int32_t ignored;
  std::set<std::string> usual_;
};
int32_t TraceTest::ignored;

// Each text at its level only: core/trace_texts.txt holds, by action, what is said. What is said of damaged
// files and of aliases shows in tests/cases/cli/trace.txt.
TEST_F(TraceTest, Texts) {
  if (access(kDefaultControl, F_OK) == 0) GTEST_SKIP();
  directory.write_locale({{367, "US-ASCII", ascii_codepage()}});
  const std::string data = directory.file("data.nls");
  const auto open_data = [&] {
    directory.write_text("data.nls", "text");
    return LXOpenFile(0, data.c_str(), LX_WRITE, 0, &ignored);
  };
  const auto locale = [](const char* name) { return [name] { LXGetLocale(name, 0, nullptr); }; };
  const auto use_twice = use([this] { init(); });
  const auto start = [this](const char* path, uint32_t options) {
    return [=] {
      init(path, options);
      terminate();
    };
  };
  const std::string long_path(250, 'x'), path = directory.path(), none = directory.file("none");
  const struct {
    const char* name;
    Action action;
  } actions[] = {
      {"use twice", use_twice},
      {"options", start(path.c_str(), 7)},
      {"no defaults", start(path.c_str(), LX_NO_DEFAULTS)},
      {"no directory", start(nullptr, 0)},
      {"long directory", start(long_path.c_str(), 0)},
      {"no control file", start(none.c_str(), 0)},
      {"no memory for the area", without_memory(1)},
      {"no memory for the manager", without_memory(2)},
      {"no memory for the records", without_memory(5)},
      {"file rewritten", use([&] { LXCloseFile(open_data(), 0); })},
      {"file gone", use([&] {
         LXFile* file = open_data();
         std::filesystem::remove(data);
         EXPECT_EQ(LXCloseFile(file, 0), 0) << "the result is the close's";
         EXPECT_FALSE(directory.exists("data.nls"));
       })},
      {"path",
       [] {
         char drive[4], part[256], file[15], extension[5];
         SplitPath("a:/d/name.ext", drive, part, file, extension);
       }},
      {"no language", use(locale("X"))},
      {"no territory", use(locale("English_X"))},
      {"no codepage", use(locale("English.X"))},
      {"no sort", use(locale("English@X"))},
      {"names", use([] {
         LXGetObjFromName(nullptr, LX_CODEPAGE, "US-ASCII@x", 8, LX_FIND_ONLY, &ignored);
         const auto english = widened<LXWChar>("English");
         LXGetObjFromNameW(nullptr, LX_LANGUAGE, english.c_str(), 8, LX_FIND_ONLY, &ignored);
       })},
  };
  std::string said = "[use]\n", expected;
  for (const std::string& line : transcript(use())) {
    usual_.insert(line);
    said += line + "\n";
  }
  setenv("LX_LOCALEDIR", path.c_str(), 1);
  for (const auto& action : actions) {
    said += "[" + std::string(action.name) + "]\n";
    for (const std::string& line : transcript(action.action)) said += line + "\n";
  }
  for (const CaseRow& row : case_rows("core/trace_texts.txt")) expected += row[0] + "\n";
  EXPECT_EQ(said, expected);
}

}  // namespace
}  // namespace lx::test
