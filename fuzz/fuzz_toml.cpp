// Any bytes as the source of a language or of a territory, as the first of them says: refused with a place, or an object
// that is dumped and compiled again.
#include <sstream>

#include "compile.h"
#include "fuzz.h"
#include "sense.h"

FUZZ_TARGET(toml) {
  using namespace lexicor_data;
  const ObjectName name{in.byte() % 2 == 0 ? ObjectType::kLanguage : ObjectType::kTerritory, 1, "Fuzz", 0};
  const std::string text = in.rest();
  const Control control{{{ObjectType::kTerritory, 1, "Fuzz", 0}, {ObjectType::kCodepage, 57352, "UTF-8", 0}}};
  try {
    std::istringstream source(text), sense(text);
    const CompiledObject object = compile_object(source, "fuzz", name, control);
    std::istringstream dumped(dump_object(read_object(object.bytes, "object"), name, &control, "object"));
    lx::test::must(compile_object(dumped, "dump", name, control).bytes == object.bytes,
                   "a dump compiles to the same");
    if (name.type == ObjectType::kLanguage)
      check_language_sense(sense, "fuzz");
    else
      check_territory_sense(sense, "fuzz");
  } catch (const SourceError&) {
  }
}
