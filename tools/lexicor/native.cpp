// lexicor native: what an operating-system name of a locale stands for, and whether its objects are there.
#include <lx.h>

#include <memory>
#include <sstream>

#include "arguments.h"
#include "command.h"
#include "locale.h"
#include "output.h"
#include "report.h"
#include "session.h"

namespace lexicor_cli {

namespace {

constexpr size_t kTitleChars = 9;  // "territory"

int native(const std::string& native_name, bool json, const CommonOptions& common) {
  const Session session(common);
  const std::string locale_name = map_native_name(native_name, kDataError);
  std::ostringstream out;
  out << padded("locale", kTitleChars) << "  " << locale_name << '\n';
  const LocaleName name(locale_name);
  size_t name_chars = 0;
  for (const LocalePart& part : name.parts) name_chars = std::max(name_chars, part.name.size());
  bool complete = true;
  Json answer = {{"native", native_name}, {"locale", locale_name}, {"objects", Json::array()}};
  for (const LocalePart& part : name.parts) {
    const int code = load_part(part);
    complete &= code == LX_OK;
    answer["objects"].push_back({{"type", part.title}, {"name", part.name}, {"there", code == LX_OK}});
    out << padded(part.title, kTitleChars) << "  " << padded(part.name, name_chars) << "  "
        << (code == LX_OK ? "there" : "missing: " + describe_code(code)) << '\n';
  }
  Output output;
  output.write(json ? json_text(answer) : out.str());
  return complete ? kDone : kDataError;
}

}  // namespace

Run declare_native(Arguments& command, const CommonOptions& common) {
  const auto name = std::make_shared<std::string>();
  const auto json = std::make_shared<bool>(false);
  command.add_option("NAME", *name, "the operating system's name of a locale, in its own letter case")
      .required()
      .type_name("");
  command.add_flag("--json", *json, "print JSON");
  command.footer(
      "Exit code 1: the name is not known, or an object that it stands for is missing.\n"
      "\n"
      "Examples:\n"
      "  lexicor native de_DE.utf8\n"
      "  lexicor list locales");
  return [name, json, &common] { return native(*name, *json, common); };
}

}  // namespace lexicor_cli
