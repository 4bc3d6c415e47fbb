// Any text as collation rules over a small root: a sort whose source is read again as the same sort, or a fault. Rules
// that were read and written are read as the same rules.
#include <sstream>

#include "fuzz.h"
#include "sort_builder.h"
#include "ucm.h"

namespace {

using namespace lexicor_data;

constexpr char kRoot[] =
    "@tables 0000..00FF 0300..03FF\n"
    "@ideographs 4E00..4EFF\n@syllables AC00..ACFF\n@computed E000..E0FF\n@uncovered D800..DFFF\n"
    "@upper 0003\n@group space 0001\n@group punct 0002\n@group digit 0004\n@group Latn 0005\n@group Grek 0009\n"
    "@combining 0301 ; 00E6\n@combining 0308 ; 00E6\n@combining 0323 ; 00DC\n"
    "@canonical 00E1 ; 0061 0301\n@canonical 00E4 ; 0061 0308\n@canonical 0344 ; 0308 0301\n"
    "0020 ; [*0001.0020.0002]\n002D ; [*0002.0020.0002]\n002E ; [*0003.0020.0002]\n0031 ; [.0004.0020.0002]\n"
    "0061 ; [.0005.0020.0002]\n0041 ; [.0005.0020.0003]\n00E1 ; [.0005.0020.0002][.0000.0021.0002]\n"
    "00E4 ; [.0005.0020.0002][.0000.0022.0002]\n00AA ; [.0005.0020.0004]\n0062 ; [.0006.0020.0002]\n"
    "0042 ; [.0006.0020.0003]\n0063 ; [.0007.0020.0002]\n00E6 ; [.0005.0021.0002][.0008.0020.0002]\n"
    "0064 ; [.0008.0020.0002]\n03B1 ; [.0009.0020.0002]\n03B2 ; [.000A.0020.0002]\n03B1 03B2 ; "
    "[.000B.0020.0002]\n"
    "0301 ; [.0000.0021.0002]\n0308 ; [.0000.0022.0002]\n0323 ; [.0000.0023.0002]\n"
    "0344 ; [.0000.0022.0002][.0000.0021.0002]\n0001 ; [.0000.0000.0000]\n";

std::string text_of(const SortSource& sort) {
  std::ostringstream out;
  write_sort(out, sort);
  return out.str();
}

SortRoot small_root() {
  std::istringstream in(kRoot);
  return read_root(in, "root");
}

}  // namespace

FUZZ_TARGET(rules) {
  static const SortRoot root = small_root();
  const std::string text = in.rest();
  try {
    std::ostringstream written, again;
    write_rules(written, read_rules(text, "rules"));
    write_rules(again, read_rules(written.str(), "written"));
    lx::test::must(again.str() == written.str(), "rules are read as they were written");
    SortNotes notes;
    const FindRules find = [&](const std::string& name) {
      return name == "own" ? RuleFile{"own", text} : RuleFile{};
    };
    const std::string sort = text_of(build_sort(root, {"rules", text}, find, notes));
    std::istringstream again_in(sort);
    lx::test::must(text_of(read_sort(again_in, "sort")) == sort, "a sort is read as it was written");
  } catch (const SourceError& error) {
    lx::test::must(!error.file.empty(), "a fault names its file");
  }
}
