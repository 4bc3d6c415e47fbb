// lexicor: conversion, mapping and sorting of text and a look into a locale directory, from the command line.
// Exit codes: 0 done, 1 an error in the data or the files, 2 a wrong command line, and of `compare` 3 and 4.
#include <lx.h>

#include <algorithm>
#include <iterator>
#include <string>
#include <utility>
#include <vector>

#include "arguments.h"
#include "command.h"
#include "program.h"

namespace {

using namespace lexicor_cli;

constexpr Subcommand kSubcommands[] = {
    {"convert", "Convert text from one codepage to another", declare_convert},
    {"translate", "Translate a field from one codepage to another, to a size", declare_translate},
    {"map", "Map text to another case or width, or to ASCII digits", declare_map},
    {"lines", "Rewrite the line ends of a text", declare_lines},
    {"sort", "Sort the lines of a text by a locale's sort", declare_sort},
    {"compare", "Tell which of two texts comes first", declare_compare},
    {"key", "Show the sort key of a text", declare_key},
    {"explain", "Show the weights of two texts, and which of them decides", declare_explain},
    {"format", "Write a number, an amount of money or a time as a locale does", declare_format},
    {"parse", "Read what a locale writes: a number, an amount of money or a time", declare_parse},
    {"message", "Fetch a message of a message catalog", declare_message},
    {"info", "Show the items of a locale", declare_info},
    {"list", "List the objects of the locale directory, or the operating system's locales", declare_list},
    {"chart", "Show a codepage, 16 by 16, and what differs from another one", declare_chart},
    {"native", "Show what an operating-system name of a locale stands for", declare_native},
};

constexpr char kFooter[] =
    "A LOCALE is LANGUAGE[_TERRITORY][.CODEPAGE][@SORT], or a name of the operating system as sv_SE.UTF-8. "
    "The\n"
    "user's locale is LX_LANG, else the operating system's.\n"
    "\n"
    "Examples:\n"
    "  lexicor list codepages\n"
    "  lexicor convert --from MS932 --to UTF-8 -o letter.utf8 letter.sjis\n"
    "  lexicor convert --from UTF-8 --to IBM930 --strict < letter.utf8 > letter.host\n"
    "  lexicor map upper --locale German letter.utf8\n"
    "  lexicor lines --from UTF-8 --eol crlf letter.utf8\n"
    "  lexicor sort --locale Swedish names.txt\n"
    "  lexicor explain --locale French@FrenchCanadian côte coté\n"
    "  lexicor format money 1234567.5 --locale German\n"
    "  lexicor info German_Austria\n"
    "  lexicor convert --help";

int run(int argc, char** argv) {
  CommandLine line("lexicor", "Lexicor: national-language support. Codepage conversion and locale data.",
                   LX_VERSION);
  CommonOptions common;
  line.arguments()
      .add_option("--locale-dir", common.locale_dir,
                  "locale directory; else LX_LOCALEDIR, else the one beside the program")
      .type_name("DIR");
  line.arguments().footer(kFooter);
  std::vector<std::pair<Arguments, Run>> runs;
  const std::string named = argc > 1 ? argv[1] : "";
  const bool known = std::any_of(std::begin(kSubcommands), std::end(kSubcommands),
                                 [&](const Subcommand& subcommand) { return subcommand.name == named; });
  for (const Subcommand& subcommand : kSubcommands) {
    // The options of the others would take longer to declare than a short text to convert.
    if (known && subcommand.name != named) continue;
    Arguments arguments = line.add_subcommand(subcommand.name, subcommand.summary);
    runs.emplace_back(arguments, subcommand.declare(arguments, common));
  }
  if (!line.parse(argc, argv)) return kDone;
  for (const auto& [arguments, action] : runs) {
    if (arguments.given()) return action();
  }
  return kUsageError;
}

}  // namespace

int main(int argc, char** argv) {
  return lexicor_cli::run_program("lexicor", run, argc, argv);
}
