// Any text as a table of collation weights: a sort whose source is read again as the same sort, and whose object is
// dumped and compiled to the same bytes, or a fault with its place.
#include <sstream>

#include "compile.h"
#include "fuzz.h"
#include "source_error.h"

FUZZ_TARGET(weights) {
  using namespace lexicor_data;
  const std::string text = in.rest();
  const auto written = [](const SortSource& sort) {
    std::ostringstream out;
    return write_sort(out, sort), out.str();
  };
  try {
    std::istringstream source(text);
    const std::string once = written(read_sort(source, "weights"));
    std::istringstream again(once), table(text);
    lx::test::must(written(read_sort(again, "written")) == once, "a sort is read as it was written");
    const ObjectName name{ObjectType::kSort, 1, "Fuzz", 0};
    const CompiledObject object = compile_object(table, "sorts/Fuzz.txt", name, {});
    std::istringstream dumped(dump_object(read_object(object.bytes, "object"), name, nullptr, "object"));
    lx::test::must(compile_object(dumped, "dump", name, {}).bytes == object.bytes,
                   "a dump compiles to the same");
  } catch (const SourceError& error) {
    lx::test::must(!error.file.empty(), "a fault names its file");
  }
}
