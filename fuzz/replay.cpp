// Runs a target over files, without a fuzzer: replay TARGET FILE_OR_DIRECTORY...
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <map>
#include <set>

#include "fuzz.h"

namespace lx::fuzz {
namespace {

std::map<std::string, Run>& targets() {
  static std::map<std::string, Run> all;
  return all;
}

void replay(Run run, const std::filesystem::path& file) {
  fprintf(stderr, "%s\n", file.c_str());  // the last one is at fault
  std::ifstream in(file, std::ios::binary);
  const std::string bytes(std::istreambuf_iterator<char>(in), {});
  must(in.good() || in.eof(), "a file is read");
  const Block<char> block(bytes);
  Input input(reinterpret_cast<const uint8_t*>(block.data()), bytes.size());
  run(input);
}

}  // namespace

Target::Target(const char* name, Run run) {
  targets()[name] = run;
}

}  // namespace lx::fuzz

int main(int argc, char** argv) {
  using namespace lx::fuzz;
  const auto found = targets().find(argc > 1 ? argv[1] : "");
  if (found == targets().end() || argc < 3) {
    fprintf(stderr, "replay TARGET FILE_OR_DIRECTORY...\nTargets:");
    for (const auto& [name, run] : targets()) fprintf(stderr, " %s", name.c_str());
    return fprintf(stderr, "\n"), 2;
  }
  std::set<std::filesystem::path> files;
  for (int i = 2; i < argc; ++i)
    if (std::filesystem::is_directory(argv[i]))
      for (const auto& entry : std::filesystem::directory_iterator(argv[i])) files.insert(entry.path());
    else
      files.insert(argv[i]);
  must(!files.empty(), "there is something to replay");
  for (const std::filesystem::path& file : files) replay(found->second, file);
}
