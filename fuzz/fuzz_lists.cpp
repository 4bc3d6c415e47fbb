// Any text as the list of a directory's objects or as the aliases of its codepages, as the first byte says: a fault with
// its place; or a list that is written, packed and read as the same, or aliases that the library knows.
#include <sstream>

#include "alias_source.h"
#include "compile.h"
#include "control_source.h"
#include "files.h"
#include "line_text.h"
#include "source_error.h"

namespace lx::fuzz::lists {
namespace {

using namespace lexicor_data;
using lexicor_data::ObjectType;

std::string text_of(const Control& control) {
  std::ostringstream out;
  return write_control(out, control), out.str();
}

void control(const std::string& text) {
  std::istringstream source(text);
  const Control read = read_control(source, "control.txt");
  const std::string once = text_of(read);
  std::istringstream written_text(once);
  must(text_of(read_control(written_text, "written")) == once, "a list is read as it was written");
  must(text_of(unpack_control(pack_control(read), "packed")) == once, "and as it was packed");
  must(!compile_control(read, "control.txt").empty(), "it compiles");
}

void aliases(Input& in) {
  const Control known{{{ObjectType::kCodepage, 367, "US-ASCII", 0}, {ObjectType::kCodepage, 819, "Fuzz", 0}}};
  std::istringstream source(in.rest()), lines(in.rest());
  const Aliases read = read_aliases(source, "alias.txt", known);
  std::string shipped;
  int number = 0;
  for (std::string line; next_line(lines, &line, &number);) shipped += line + '\n';
  const FileLibrary library("alias.txt",
                            Input(reinterpret_cast<const uint8_t*>(shipped.data()), shipped.size()));
  for (const auto& [alias, codepage] : read) {
    const char* const found = LXGetCodepageFromAlias(nullptr, alias.c_str());
    must(found != nullptr && LXmemicmp(found, codepage.c_str(), codepage.size() + 1) == 0,
         "the library knows an alias");
  }
}

}  // namespace

FUZZ_TARGET(lists) {
  try {
    if (in.flag())
      control(in.rest());
    else
      aliases(in);
  } catch (const SourceError& error) {
    must(!error.file.empty(), "a fault names its file");
  }
}

}  // namespace lx::fuzz::lists
