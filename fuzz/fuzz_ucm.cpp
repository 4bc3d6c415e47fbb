// Any bytes as the source of a codepage: refused with a place, or a table that is written and read again, and packs.
#include <sstream>

#include "compile.h"
#include "fuzz.h"
#include "ucm.h"

FUZZ_TARGET(ucm) {
  using namespace lexicor_data;
  const std::string text = in.rest();
  const ObjectName name{ObjectType::kCodepage, 5000, "Fuzz", 0};
  try {
    std::istringstream source_in(text);
    const CodepageSource source = read_ucm(source_in, "fuzz/Fuzz.ucm");
    std::stringstream plain, brief, again;
    write_ucm(plain, source);
    write_ucm_source(brief, source, nullptr);
    write_ucm(again, read_ucm(brief, "brief"));
    lx::test::must(plain.str() == again.str(), "the short form says the same");
    std::istringstream compiled(text);
    const CompiledObject object = compile_object(compiled, "fuzz/Fuzz.ucm", name, {});
    std::istringstream dumped(dump_object(read_object(object.bytes, "object"), name, nullptr, "object"));
    lx::test::must(compile_object(dumped, "dump", name, {}).bytes == object.bytes,
                   "a dump compiles to the same");
  } catch (const SourceError&) {
  }
}
