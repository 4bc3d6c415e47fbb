// Any bytes as a message source, X/Open or PO, for a catalog in one of several codepages, as the first bytes say: faults
// with their places; or a catalog that is packed and written as a source and read as the same, whose messages the library
// finds.
#include "builder.h"
#include "catalog_file.h"
#include "fuzz.h"
#include "lexicor/codepage.h"
#include "lexicor/session.h"
#include "message_source.h"
#include "po_source.h"
#include "source_writer.h"
#include "support/object_files.h"

namespace lx::fuzz::messages {
namespace {

using namespace lexicor_gencat;

/// Codepages as sources and catalogs are in them.
struct Opened {
  Opened(const lexicor_cli::Session& session, const std::string& name)
      : codepage(session, name), encoding(codepage) {}
  lexicor_cli::Codepage codepage;
  Encoding encoding;
};
const Opened& opened(uint32_t number) {
  static const lexicor_cli::Session session({LEXICOR_LOCALE_DIR});
  static const Opened all[] = {
      {session, "UTF-8"}, {session, "Latin1"}, {session, "MS932"}, {session, "IBM930"}};
  return all[number];
}

/// The bytes of the catalog; empty where the source has faults.
std::string compiled(const std::string& source, bool po, const Recoder& recoder) {
  const std::string codepage = recoder.target().codepage().name();
  Problems problems;
  CatalogBuilder builder({"English_UnitedStates." + codepage, native_byte_order(), {}}, problems);
  builder.begin_source();
  if (po) {
    po_charset(source);
    read_po_source(source, "source.po", recoder, builder, problems);
  } else {
    read_declarations(source, &recoder.source());
    read_message_source(source, "source.msg", recoder, builder, problems);
  }
  for (const std::string& line : problems.lines())
    must(line.compare(0, 7, "source.") == 0, "a fault names its file");
  must(problems.errors() == 0 || !problems.lines().empty(), "a fault is said");
  return problems.errors() != 0 ? "" : pack_catalog(builder.take());
}

void found(const std::string& path, const Catalog& catalog) {
  LXLocale* const l = LXGetLocale(catalog.locale.c_str(), 0, nullptr);
  if (l == nullptr || catalog.byte_order != native_byte_order() || catalog.sets.empty())
    return static_cast<void>(LXReleaseLocale(l));
  for (const uint32_t mode : {0u, uint32_t{LX_CATALOG_LOAD}}) {
    LXCatalog* const opened = LXOpenCatalog(l, nullptr, path.c_str(), mode);
    must(opened != nullptr, "a catalog is opened");
    for (const auto& [set, texts] : catalog.sets)
      for (const auto& [number, text] : texts) {
        // Loaded mode looks for others from the place where a number stands when all from 1 on are there.
        if (texts.count(0) != 0 || catalog.sets.count(0) != 0) continue;
        char out[40];
        must(LXGetMessage(opened, set, number, out, sizeof(out), nullptr) == LX_OK, "a message is found");
      }
    LXCloseCatalog(opened);
  }
  LXReleaseLocale(l);
}

}  // namespace

FUZZ_TARGET(messages) {
  static const ScratchDirectory directory;
  const bool po = in.flag();
  const Encoding &from = opened(in.below(4)).encoding, &to = opened(in.below(4)).encoding;
  const std::string bytes = compiled(in.rest(), po, Recoder(from, to));
  if (bytes.empty()) return;
  const Catalog catalog = unpack_catalog(bytes, "catalog");
  must(pack_catalog(catalog) == bytes, "a catalog is read as it was packed");
  directory.write_text("catalog", bytes);
  found(directory.file("catalog"), catalog);
  for (const Encoding* const encoding : {&from, &to})
    must(compiled(write_source(catalog, to, *encoding), false, Recoder(*encoding, to)) == bytes,
         "a dump compiles to the same");
}

}  // namespace lx::fuzz::messages
