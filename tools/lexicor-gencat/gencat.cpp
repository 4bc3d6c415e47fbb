// Which locale, which codepages and which byte order hold; then one source behind the other.
#include "gencat.h"

#include <sys/stat.h>

#include <cstdio>
#include <filesystem>
#include <map>
#include <memory>
#include <optional>
#include <ostream>

#include "builder.h"
#include "lexicor/input.h"
#include "lexicor/locale.h"
#include "lexicor/notices.h"
#include "lexicor/output.h"
#include "message_source.h"
#include "po_source.h"
#include "source_writer.h"

namespace lexicor_gencat {

using lexicor_cli::Failure;
using lexicor_cli::kDataError;
using lexicor_cli::kUsageError;

namespace {

constexpr char kStandardStream[] = "-";

std::string read_all(const std::string& name) {
  lexicor_cli::Input input({name});
  std::string text;
  char piece[16384];
  for (size_t got; (got = input.read(piece, sizeof piece)) > 0;) text.append(piece, got);
  return text;
}

bool is_regular_file_with_content(const std::string& name) {
  struct stat status;
  return stat(name.c_str(), &status) == 0 && S_ISREG(status.st_mode) && status.st_size > 0;
}

bool is_po_name(const std::string& name) {
  constexpr char kSuffix[] = ".po";
  return name.size() > 3 && name.compare(name.size() - 3, 3, kSuffix) == 0;
}

/// Codepages by name, each opened once.
class Encodings {
 public:
  explicit Encodings(const lexicor_cli::Session& session) : session_(session) {}

  /// Throws a Failure when there is no such codepage. `who` is the file that names it; empty: the command line.
  const Encoding& get(const std::string& name, const std::string& who) {
    std::unique_ptr<Opened>& opened = opened_[name];
    if (opened == nullptr) blaming(who, [&] { opened = std::make_unique<Opened>(session_, name); });
    return opened->encoding;
  }

  /// The encoding of a locale's codepage; likewise.
  const Encoding& of_locale(const std::string& locale, const std::string& who) {
    std::string codepage;
    blaming(who, [&] {
      const lexicor_cli::LocalePtr opened = lexicor_cli::open_locale(locale);
      codepage = lexicor_cli::text_item(opened.get(), LX_ITEM_CODEPAGE).value_or("");
    });
    return get(codepage, who);
  }

 private:
  template <class Step>
  static void blaming(const std::string& who, Step step) {
    try {
      step();
    } catch (const Failure& failure) {
      if (who.empty()) throw;
      throw Failure(kDataError, who + ": " + failure.what());
    }
  }

  struct Opened {
    Opened(const lexicor_cli::Session& session, const std::string& name)
        : codepage(session, name), encoding(codepage) {}
    lexicor_cli::Codepage codepage;
    Encoding encoding;
  };

  const lexicor_cli::Session& session_;
  std::map<std::string, std::unique_ptr<Opened>> opened_;
};

struct Source {
  std::string name;  // for messages
  std::string text;
  bool po;
  Declarations declared;
};

/// The order that a name says, in any letter case; nothing for another name.
std::optional<ByteOrder> byte_order_of(const std::string& name) {
  if (lexicor_cli::same_name(name, "big")) return ByteOrder::kBig;
  if (lexicor_cli::same_name(name, "little")) return ByteOrder::kLittle;
  return std::nullopt;
}

void check_byte_order(const Source& source) {
  const Declarations& declared = source.declared;
  if (declared.byte_order.empty() || byte_order_of(declared.byte_order).has_value()) return;
  throw Failure(kDataError, source.name + ":" + std::to_string(declared.byte_order_line) +
                                ": byte-order=" + declared.byte_order + "; expected big or little");
}

std::vector<Source> read_sources(const Options& options, const Encoding* encoding) {
  std::vector<std::string> names = options.sources;
  if (names.empty()) names.push_back(kStandardStream);
  std::vector<Source> sources;
  for (const std::string& name : names) {
    Source source;
    source.name = name == kStandardStream ? "standard input" : name;
    source.text = read_all(name);
    source.po = options.po || is_po_name(name);
    if (source.po)
      source.declared.codeset = po_charset(source.text);
    else
      source.declared = read_declarations(source.text, encoding);
    source.declared.locale = lexicor_cli::core_name(source.declared.locale);
    check_byte_order(source);
    sources.push_back(std::move(source));
  }
  return sources;
}

/// The first source that declares something; null: none does.
const Source* first_declaring(const std::vector<Source>& sources, std::string Declarations::*field) {
  for (const Source& source : sources) {
    if (!(source.declared.*field).empty()) return &source;
  }
  return nullptr;
}

struct ChosenLocale {
  std::string name;
  std::string who;  // the file that names it; empty: the command line
};

ChosenLocale choose_locale(const Options& options, const Catalog* existing, const std::vector<Source>& sources,
                           Encodings& encodings) {
  const std::string asked = lexicor_cli::core_name(options.locale);
  if (existing != nullptr) {
    if (!asked.empty() && !lexicor_cli::same_name(asked, existing->locale))
      throw Failure(kUsageError, options.catalog + ": its texts are in " + existing->locale + ", not in " +
                                     options.locale + "; --new replaces it");
    return {existing->locale, options.catalog};
  }
  if (!asked.empty()) return {asked, ""};
  const Source* declaring = first_declaring(sources, &Declarations::locale);
  if (declaring != nullptr) return {declaring->declared.locale, declaring->name};
  std::string codepage = options.source_encoding, who;
  declaring = first_declaring(sources, &Declarations::codeset);
  if (codepage.empty() && declaring != nullptr) {
    codepage = declaring->declared.codeset;
    who = declaring->name;
  }
  if (codepage.empty()) codepage = kDefaultCodepage;
  // By the name of the object: a locale's name takes no alias.
  return {std::string(kDefaultLanguage) + "." + encodings.get(codepage, who).codepage().name(), who};
}

ByteOrder choose_byte_order(const Options& options, const Catalog* existing,
                            const std::vector<Source>& sources) {
  std::string name = options.byte_order;
  if (name.empty() && existing != nullptr) return existing->byte_order;
  const Source* const declaring = first_declaring(sources, &Declarations::byte_order);
  if (name.empty() && declaring != nullptr) name = declaring->declared.byte_order;
  return byte_order_of(name).value_or(native_byte_order());
}

const Encoding& declared_encoding(const Source& source, const Options& options, const Encoding& target,
                                  Encodings& encodings) {
  if (!options.source_encoding.empty()) return encodings.get(options.source_encoding, "");
  if (!source.declared.codeset.empty()) return encodings.get(source.declared.codeset, source.name);
  if (source.po) return encodings.get(kDefaultCodepage, source.name);
  if (!source.declared.locale.empty()) return encodings.of_locale(source.declared.locale, source.name);
  if (has_byte_order_mark(source.text)) return encodings.get(kDefaultCodepage, source.name);
  return target;
}

const Encoding& encoding_of(const Source& source, const Options& options, const Encoding& target,
                            Encodings& encodings) {
  const Encoding& encoding = declared_encoding(source, options, target, encodings);
  if (has_byte_order_mark(source.text) && !encoding.codepage().utf8())
    throw Failure(kDataError, source.name + ": begins with the byte-order mark of UTF-8, but its codepage is " +
                                  encoding.codepage().name());
  return encoding;
}

std::string header_text(const std::vector<Symbol>& symbols) {
  std::string text;
  std::map<std::string, Place> defined;
  char number[16];
  for (const Symbol& symbol : symbols) {
    const auto [entry, is_new] = defined.emplace(symbol.name, symbol.place);
    if (!is_new)
      throw Failure(kDataError, place_text(symbol.place) + ": the header defines " + symbol.name +
                                    " already, for " + place_text(entry->second) + "; expected other names");
    std::snprintf(number, sizeof number, "%#x", static_cast<unsigned>(symbol.number));
    text += "#define " + symbol.name + " " + number + "\t/* " + symbol.place.file + ":" +
            std::to_string(symbol.place.line) + " */\n";
  }
  return text;
}

/// A name in a working directory that is gone stays as it is.
std::filesystem::path absolute_path(const std::string& name) {
  std::error_code error;
  const std::filesystem::path path = std::filesystem::absolute(name, error);
  return (error ? std::filesystem::path(name) : path).lexically_normal();
}

bool same_file(const std::string& a, const std::string& b) {
  struct stat first, second;
  if (stat(a.c_str(), &first) != 0 || stat(b.c_str(), &second) != 0)
    return absolute_path(a) == absolute_path(b);
  return S_ISREG(first.st_mode) && first.st_dev == second.st_dev && first.st_ino == second.st_ino;
}

/// The header replaces neither the catalog nor a source, nor does the catalog a source.
void check_outputs(const Options& options) {
  const auto refuse = [](const std::string& output, const char* what, const std::string& other) {
    if (output.empty() || output == kStandardStream || !same_file(output, other)) return;
    throw Failure(kUsageError, output + ": is " + what + ", expected another file for the output");
  };
  refuse(options.header, "the catalog", options.catalog);
  for (const std::string& source : options.sources) {
    refuse(options.header, "a source", source);
    refuse(options.catalog, "a source", source);
  }
}

/// Both files appear, or neither does when one cannot be written.
void write_files(const Options& options, const std::string& catalog, const std::string& header) {
  lexicor_cli::Output catalog_file(options.catalog);
  catalog_file.write(catalog);
  std::optional<lexicor_cli::Output> header_file;
  if (!options.header.empty()) {
    header_file.emplace(options.header);
    header_file->write(header);
  }
  catalog_file.commit();
  if (header_file.has_value()) header_file->commit();
}

}  // namespace

bool compile(const lexicor_cli::Session& session, const Options& options, std::ostream& log) {
  check_outputs(options);
  Encodings encodings(session);
  std::optional<Catalog> existing;
  if (!options.fresh && options.catalog != kStandardStream && is_regular_file_with_content(options.catalog))
    existing = unpack_catalog(read_all(options.catalog), options.catalog);
  const Catalog* const merged = existing.has_value() ? &*existing : nullptr;
  const Encoding* const given =
      options.source_encoding.empty() ? nullptr : &encodings.get(options.source_encoding, "");
  const std::vector<Source> sources = read_sources(options, given);

  Catalog catalog;
  const ChosenLocale locale = choose_locale(options, merged, sources, encodings);
  catalog.locale = locale.name;
  catalog.byte_order = choose_byte_order(options, merged, sources);
  if (existing.has_value()) catalog.sets = std::move(existing->sets);
  const Encoding& target = encodings.of_locale(locale.name, locale.who);

  Problems problems(!lexicor_cli::g_quiet);
  CatalogBuilder builder(std::move(catalog), problems);
  for (const Source& source : sources) {
    const Recoder recoder(encoding_of(source, options, target, encodings), target);
    (source.po ? read_po_source : read_message_source)(source.text, source.name, recoder, builder, problems);
  }
  for (const std::string& line : problems.lines()) log << line << '\n';
  if (problems.errors() > 0) return false;
  const std::string header = options.header.empty() ? "" : header_text(builder.symbols());
  write_files(options, pack_catalog(builder.take()), header);
  return true;
}

void dump(const lexicor_cli::Session& session, const Options& options) {
  Encodings encodings(session);
  const std::string name = options.catalog == kStandardStream ? "standard input" : options.catalog;
  const Catalog catalog = unpack_catalog(read_all(options.catalog), name);
  const Encoding& own = encodings.of_locale(catalog.locale, name);
  const Encoding& source =
      encodings.get(options.source_encoding.empty() ? kDefaultCodepage : options.source_encoding, "");
  lexicor_cli::Output output(options.output);
  output.write(write_source(catalog, own, source));
  output.commit();
}

}  // namespace lexicor_gencat
