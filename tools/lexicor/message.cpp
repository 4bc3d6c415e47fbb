// lexicor message: a message of a message catalog, in the codepage of the caller.
#include <lx.h>

#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <memory>
#include <optional>
#include <sstream>
#include <vector>

#include "arguments.h"
#include "catalogue.h"
#include "codepage.h"
#include "command.h"
#include "locale.h"
#include "output.h"
#include "session.h"

namespace lexicor_cli {

namespace {

constexpr char kSearchVariable[] = "LX_NLSPATH";
constexpr size_t kSearchVariableBytes = 27;  // a longer value is not used
constexpr size_t kMessageBytes = 4096;       // to begin with
constexpr size_t kMostCharBytes = 5;         // a shift byte with it

struct MessageOptions {
  std::string catalog;
  uint32_t set = 0;
  uint32_t number = 0;
  std::optional<std::string> default_text;
  std::string locale;  // empty: the user's
  std::string codepage = "UTF-8";
  std::string directory;
  bool load = false;
  bool one_locale = false;

  uint32_t flags() const { return load ? LX_CATALOG_LOAD : one_locale ? LX_CATALOG_ONE_LOCALE : 0; }
};

struct CatalogCloser {
  void operator()(LXCatalog* catalog) const { LXCloseCatalog(catalog); }
};
using CatalogPtr = std::unique_ptr<LXCatalog, CatalogCloser>;

/// Which templates the search went through, and what may be wrong with them.
class SearchReport {
 public:
  SearchReport(const MessageOptions& options, LXLocale* locale) {
    text_ << "searched:";
    add("--directory", options.directory);
    const char* const variable = secure_getenv(kSearchVariable);
    if (variable != nullptr && std::strlen(variable) > kSearchVariableBytes)
      text_ << "\n  " << kSearchVariable << " is not used: it has " << std::strlen(variable) << " bytes, and "
            << kSearchVariableBytes << " are the most";
    else
      add(kSearchVariable, variable != nullptr ? variable : "");
    add("name", options.catalog);
    text_ << "\n  with %N = " << options.catalog
          << ", %l = " << text_item(locale, LX_ITEM_LANGUAGE_ABBREVIATION).value_or("")
          << ", %t = " << text_item(locale, LX_ITEM_TERRITORY_ABBREVIATION).value_or("")
          << (options.flags() == 0 ? ", then with those of the default locale" : "");
  }

  std::string text() const { return text_.str() + hints_; }

 private:
  void add(const char* title, const std::string& templates) {
    if (templates.empty()) return;
    text_ << "\n  " << title << ": " << templates;
    std::istringstream elements(templates);
    std::error_code error;
    for (std::string element; std::getline(elements, element, ';');)
      if (std::filesystem::is_directory(element, error))
        hints_ += "\n" + element + " is a directory: a template names a file, as " + element + "/%N does";
  }

  std::ostringstream text_;
  std::string hints_;
};

CatalogPtr open_catalog(const MessageOptions& options, LXLocale* locale) {
  CatalogPtr catalog(
      LXOpenCatalog(locale, options.directory.c_str(), options.catalog.c_str(), options.flags()));
  if (catalog != nullptr) return catalog;
  const int32_t code = LXGetError(locale);
  if (code == LX_E_INVALID) throw Failure(kUsageError, "the catalog has no name");
  if (code != LX_E_CATALOG) throw Failure(kDataError, "the catalog cannot be opened: " + describe_code(code));
  throw Failure(kDataError, "no catalog '" + options.catalog + "' found" +
                                (options.load ? ", or it is damaged" : "") + "; " +
                                SearchReport(options, locale).text());
}

/// A UTF-8 text in the codepage of the caller.
std::string recoded(const std::string& utf8_text, const Codepage& utf8, const Codepage& caller) {
  std::string text((utf8_text.size() + 1) * kMostCharBytes, '\0');
  const int32_t bytes = LXConvertStringEx(
      caller.locale(), text.data(), LX_SHIFT_SINGLE, static_cast<int32_t>(text.size()), utf8.locale(),
      utf8_text.data(), LX_SHIFT_SINGLE, static_cast<int32_t>(utf8_text.size()), LX_TERMINATE);
  text.resize(static_cast<size_t>(bytes) - 1);
  return text;
}

/// The whole message: what fills the buffer is asked for again.
std::string fetch(const MessageOptions& options, LXLocale* locale,
                  const std::optional<std::string>& default_text) {
  const CatalogPtr catalog = open_catalog(options, locale);
  std::vector<char> text(kMessageBytes);
  for (;; text.resize(2 * text.size())) {
    const int32_t code =
        LXGetMessage(catalog.get(), options.set, options.number, text.data(), static_cast<int32_t>(text.size()),
                     default_text ? default_text->c_str() : nullptr);
    if (code == LX_E_MESSAGE)
      throw Failure(kDataError, "the catalog '" + options.catalog + "' has no message " +
                                    std::to_string(options.number) + " in set " + std::to_string(options.set));
    if (code != LX_OK)
      throw Failure(kDataError, "the catalog that was found for '" + options.catalog +
                                    "' is damaged, unreadable, or of another machine; " +
                                    SearchReport(options, locale).text());
    const size_t bytes = std::strlen(text.data());
    if (bytes + kMostCharBytes < text.size() || text.size() > INT32_MAX / 2) return {text.data(), bytes};
  }
}

int message(const MessageOptions& options, const CommonOptions& common) {
  const Session session(common);
  const std::string language = language_territory(open_chosen_locale(options.locale).get());
  const Codepage utf8(session, "UTF-8", language);
  const Codepage caller(session, options.codepage, language);
  // Abbreviations become part of a path in the codepage of the locale that opens the catalog. Paths are ASCII.
  if (number_item(caller.locale(), LX_ITEM_CODEPAGE_ASCII) != 1) {
    Output().write(recoded(fetch(options, utf8.locale(), options.default_text) + "\n", utf8, caller));
    return kDone;
  }
  std::optional<std::string> default_text;
  if (options.default_text) default_text = recoded(*options.default_text, utf8, caller);
  Output().write(fetch(options, caller.locale(), default_text) + recoded("\n", utf8, caller));
  return kDone;
}

}  // namespace

Run declare_message(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<MessageOptions>();
  command.add_option("CATALOG", options->catalog, "name of the catalog, or its path").required().type_name("");
  command.add_option("SET", options->set, "number of the set").required().type_name("");
  command.add_option("NUMBER", options->number, "number of the message").required().type_name("");
  command.add_option("--default", options->default_text, "what to print when there is no such message")
      .type_name("TEXT");
  command
      .add_option("--locale", options->locale, "locale whose %l, %t and %L are taken; else the user's locale")
      .type_name("LOCALE");
  command
      .add_option("--codepage", options->codepage,
                  "codepage of the caller, in which the message comes; else UTF-8")
      .type_name("CP");
  command
      .add_option(
          "--directory", options->directory,
          "templates of paths, divided by ';', looked at before those of LX_NLSPATH and the name itself")
      .type_name("TEMPLATES");
  command.add_flag("--load", options->load, "read the whole catalog at once, for this locale only");
  command.add_flag("--one-locale", options->one_locale, "do not look for the default locale's catalog");
  command.footer(
      "In a template %N is the name, %l the language's and %t the territory's abbreviation, %L both with _,\n"
      "and %% a percent sign.\n"
      "\n"
      "Examples:\n"
      "  lexicor message ./app.cat 1 3\n"
      "  lexicor message ./app.cat 1 3 --codepage IBM930 > message.host\n"
      "  lexicor message app 1 3 --locale German_Germany --directory 'cats/%L/%N.cat' --default Hello");
  return [options, &common] { return message(*options, common); };
}

}  // namespace lexicor_cli
