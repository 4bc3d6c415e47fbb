// Any bytes as the file of a codepage, or of UTF-8 as the first of them says: refused, or every look-up, walk and conversion is safe with it; and as the two
// sections of a codepage of version 1.
#include "files.h"
#include "support/use_codepage.h"

FUZZ_TARGET(codepage) {
  using namespace lx::fuzz;
  const bool utf8 = in.flag();
  const FileLibrary library(utf8 ? "cp_57352.nls" : "cp_00819.nls", in, utf8 ? "UTF-8" : "Fuzz");
  if (library.locale() != nullptr) {
    look_up(library.locale(), 61);
    use_text(library.locale(), 13);
    use_items(library.locale());
  }
  const Block<char> payload(in.bytes(6000)), section(in.rest());
  void* new_section = nullptr;
  void* const upgraded =
      LXCpV1toV2(payload.data(), payload.size(), section.data(), section.size(), &new_section);
  must(upgraded != nullptr || new_section == nullptr, "both blocks or none");
  LXMcFree(upgraded), LXMcFree(new_section);
}
