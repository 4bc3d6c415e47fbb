// Faults of sources: each file of tests/cases/faults is a sound source. Below a line stand bad ones that take
// its place, and what is said of the source then:
//   #! TEXT       a line in place of the one above; several, or none at all
//   #= C: TEXT    how the message begins: the column in the line replaced, and what is wrong. The place may be
//                 +N:C for N lines below, or begin with the word file. "accepted": nothing is wrong
//   #. C: TEXT    the same of a source that ends there, without a line end
//   ## TEXT       a comment on what follows
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <utility>

#include "alias_source.h"
#include "compile.h"
#include "control_source.h"
#include "language_toml.h"
#include "sense.h"
#include "sort_pack.h"
#include "territory_toml.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

namespace fs = std::filesystem;
const fs::path kFaults = LEXICOR_DATA_DIR "/../tests/cases/faults";

using Lines = std::vector<std::string>;
struct Fault {
  size_t line;  // that is replaced
  Lines instead;
  bool ends;
  std::string said;
};
struct FaultFile {
  Lines sound;
  std::vector<Fault> faults;
};

FaultFile read_faults(const fs::path& path) {
  FaultFile file;
  Lines instead;
  std::ifstream in(path, std::ios::binary);
  for (std::string line; std::getline(in, line);) {
    const std::string mark = line.substr(0, 2), rest = line.size() > 3 ? line.substr(3) : "";
    if (mark == "##") continue;
    if (mark == "#!") {
      instead.push_back(rest);
    } else if (mark == "#=" || mark == "#.") {
      file.faults.push_back({file.sound.size(), std::exchange(instead, {}), mark == "#.", rest});
    } else {
      EXPECT_TRUE(instead.empty()) << path << ": nothing is said of the lines before " << line;
      file.sound.push_back(line);
    }
  }
  EXPECT_TRUE(instead.empty()) << path << ": nothing is said of the last lines";
  return file;
}

std::string text_of(const FaultFile& file, const Fault* fault) {
  std::string text;
  for (size_t line = 1; line <= file.sound.size(); ++line) {
    if (fault == nullptr || line != fault->line) {
      text += file.sound[line - 1] + '\n';
      continue;
    }
    for (const std::string& instead : fault->instead) text += instead + '\n';
    if (!fault->ends) continue;
    if (!text.empty()) text.pop_back();
    break;
  }
  return text;
}

/// The message that is expected of a file with this name.
std::string message_of(const Fault& fault, const std::string& name) {
  std::istringstream said(fault.said);
  size_t below = 0;
  if (fault.said == "accepted") return fault.said;
  if (fault.said.rfind("file", 0) == 0) return name + fault.said.substr(4);
  if (said.peek() == '+') said >> below, said.get();
  return name + ':' + std::to_string(fault.line + below) + ':' +
         fault.said.substr(static_cast<size_t>(said.tellg()));
}

/// What is said of a source; its file's name tells which kind it is.
std::string said_of(const std::string& name, const std::string& text) {
  const auto is = [&](const char* kind) { return name.find(kind) != std::string::npos; };
  std::istringstream list(text_of(read_faults(kFaults / "control.txt"), nullptr));
  const Control control = read_control(list, "control.txt");
  std::istringstream in(text), again(text);
  try {
    if (is(".ucm")) read_ucm(in, name);
    if (is("sort")) pack_sort(read_sort(in, name), name);
    if (is("control")) read_control(in, name);
    if (is("alias")) check_aliases(in, name, control);
    if (is("language")) read_language(in, name, control), check_language_sense(again, name);
    if (is("territory")) read_territory(in, name), check_territory_sense(again, name);
  } catch (const SourceError& error) {
    return error.what();
  }
  return in.tellg() == 0 ? "not read" : "accepted";
}

TEST(Sources, FaultsNameTheirPlace) {
  for (const auto& entry : fs::directory_iterator(kFaults)) {
    const std::string name = entry.path().filename().string();
    const FaultFile file = read_faults(entry.path());
    EXPECT_EQ(said_of(name, text_of(file, nullptr)), "accepted") << name;
    EXPECT_FALSE(file.faults.empty()) << name;
    for (const Fault& fault : file.faults) {
      const std::string expected = message_of(fault, name), said = said_of(name, text_of(file, &fault));
      EXPECT_EQ(said.substr(0, expected.size()), expected) << said << "\nof\n" << text_of(file, &fault);
    }
  }
}

}  // namespace
}  // namespace lexicor_data
