// lexicor chart: a codepage, 16 by 16: its characters, their types, and what differs from another one; one page on the
// terminal, or all of them as one page of HTML.
#include <lx.h>

#include <algorithm>
#include <charconv>
#include <memory>
#include <sstream>

#include "arguments.h"
#include "chart_page.h"
#include "command.h"
#include "hex.h"
#include "output.h"
#include "report.h"
#include "utf8_text.h"

namespace lexicor_cli {

namespace {

struct ChartOptions {
  std::string codepage, other, lead, output = "-";
  bool html = false, types = false, json = false;
};

constexpr int kRow = 16;

const ChartPage& page_of(const std::vector<ChartPage>& pages, const std::string& lead,
                         const std::string& codepage) {
  uint32_t value = 0;
  const char* const end = lead.data() + lead.size();
  if (!lead.empty()) {
    const auto read = std::from_chars(lead.data(), end, value, 16);
    if (read.ec != std::errc() || read.ptr != end || lead.size() % 2 != 0)
      throw Failure(kUsageError,
                    "--lead takes the bytes before the last one in hexadecimal, as 45, not '" + lead + "'");
  }
  for (const ChartPage& page : pages) {
    if (page.lead == value) return page;
  }
  throw Failure(kUsageError, codepage + " has no characters that begin with " + lead);
}

/// Its columns are those of the widest sign, with a mark where the other codepage has something else.
void write_grid(const ChartPage& page, bool types, std::ostream& out) {
  out << "   ";
  for (int column = 0; column < kRow; ++column) out << "  -" << hex_text(static_cast<uint32_t>(column), 1);
  out << '\n';
  for (size_t row = 0; row < kRow; ++row) {
    std::string line = hex_text(static_cast<uint32_t>(row), 1) + "- ";
    for (size_t column = 0; column < kRow; ++column) {
      const ChartCell& cell = page.cells[row * kRow + column];
      const std::string sign = types ? std::string(1, cell.letter()) : cell.sign;
      line += (cell.differs ? " *" : "  ") + sign + (types || cell.columns() == 1 ? " " : "");
    }
    line.erase(line.find_last_not_of(' ') + 1);
    out << line << '\n';
  }
}

void write_differences(const ChartPage& page, const std::string& codepage, const std::string& other,
                       std::ostream& out) {
  for (const ChartCell& cell : page.cells) {
    if (!cell.differs) continue;
    out << "  " << hex_text(cell.code, cell.code > 0xFF ? 4 : 2) << "  " << codepage << ' '
        << (cell.kind == ChartCell::Kind::kCharacter ? code_point_name(cell.unicode) + " " + cell.sign : "none")
        << "  " << other << ' ' << cell.other << '\n';
  }
}

std::string as_text(const std::vector<ChartPage>& pages, const ChartOptions& options, const Codepage& codepage,
                    const Codepage* other) {
  const ChartPage& page = page_of(pages, options.lead, codepage.name());
  std::ostringstream out;
  out << codepage.name() << ", " << static_cast<char>(std::tolower(page.title()[0])) << page.title().substr(1)
      << "\n\n";
  write_grid(page, options.types, out);
  if (pages.size() > 1) {
    out << "\n" << pages.size() - 1 << " pages of longer characters: --lead";
    for (size_t i = 1; i < pages.size() && i < 4; ++i)
      out << ' ' << hex_text(pages[i].lead, pages[i].lead > 0xFF ? 4 : 2);
    out << (pages.size() > 4 ? " ...\n" : "\n");
  }
  if (other != nullptr) {
    size_t all = 0;
    for (const ChartPage& each : pages) all += each.differences;
    out << "\nDifferences from " << other->name() << ": " << page.differences << " here, " << all
        << " in all\n";
    write_differences(page, codepage.name(), other->name(), out);
  }
  return out.str();
}

// HTML.

std::string escaped(const std::string& text) {
  std::string result;
  for (const char c : text)
    result += c == '&' ? "&amp;" : c == '<' ? "&lt;" : c == '"' ? "&quot;" : std::string(1, c);
  return result;
}

constexpr char kStyle[] =
    "body{font-family:sans-serif;margin:2em}table{border-collapse:collapse;margin-bottom:2em}"
    "caption{text-align:left;font-weight:bold;padding:.3em 0}th{font-weight:normal;color:#777}"
    "td{border:1px solid #ccc;width:2.2em;height:2.2em;text-align:center;font-size:1.1em}"
    "td.U,td.L,td.A{background:#eef6ff}td.D{background:#effbef}td.P{background:#fff8e6}"
    "td.S,td.C{color:#999;background:#f6f6f6}td.n{color:#ddd}td.l{color:#a6a6f0}"
    "td.differs{outline:2px solid #d33;outline-offset:-2px}td small{display:block;font-size:.6em;color:#b00}"
    "nav a{margin-right:.6em}";

void write_table(const ChartPage& page, std::ostream& out) {
  out << "<table id=\"p" << hex_text(page.lead, 2) << "\"><caption>" << page.title();
  if (page.differences != 0) out << ", differences: " << page.differences;
  out << "</caption>\n<tr><th></th>";
  for (uint32_t column = 0; column < kRow; ++column) out << "<th>-" << hex_text(column, 1) << "</th>";
  out << "</tr>\n";
  for (size_t row = 0; row < kRow; ++row) {
    out << "<tr><th>" << hex_text(static_cast<uint32_t>(row), 1) << "-</th>";
    for (size_t column = 0; column < kRow; ++column) {
      const ChartCell& cell = page.cells[row * kRow + column];
      const char letter = cell.letter();
      out << "<td class=\""
          << (cell.kind == ChartCell::Kind::kNone ? "n"
              : letter == ' '                     ? "l"
                                                  : std::string(1, letter))
          << (cell.differs ? " differs" : "") << "\" title=\"" << hex_text(cell.code, 2) << ": "
          << cell.description() << "\">" << escaped(cell.sign);
      if (cell.differs) out << "<small>" << escaped(cell.other) << "</small>";
      out << "</td>";
    }
    out << "</tr>\n";
  }
  out << "</table>\n";
}

std::string as_html(const std::vector<ChartPage>& pages, const Codepage& codepage, const Codepage* other) {
  const std::string title =
      "Codepage " + codepage.name() + (other != nullptr ? ", beside " + other->name() : std::string());
  std::ostringstream out;
  out << "<!DOCTYPE html>\n<html lang=\"en\"><head><meta charset=\"utf-8\"><title>" << escaped(title)
      << "</title>\n<style>" << kStyle << "</style></head>\n<body><h1>" << escaped(title) << "</h1>\n<nav>";
  for (const ChartPage& page : pages)
    out << "<a href=\"#p" << hex_text(page.lead, 2) << "\">"
        << (page.lead == 0 ? "single" : hex_text(page.lead, 2)) << "</a>";
  out << "</nav>\n";
  for (const ChartPage& page : pages) write_table(page, out);
  out << "</body></html>\n";
  return out.str();
}

// JSON.

Json json_of(const ChartCell& cell, const Codepage* other) {
  constexpr const char* kKinds[] = {"none", "character", "lead", "shift"};
  Json json = {{"code", hex_text(cell.code, cell.code > 0xFF ? 4 : 2)},
               {"kind", kKinds[static_cast<size_t>(cell.kind)]}};
  if (cell.kind == ChartCell::Kind::kCharacter) {
    std::istringstream words(cell.description());
    std::string word;
    words >> word;
    json["character"] = word;
    json["text"] = utf8_text(std::u16string(1, static_cast<char16_t>(cell.unicode)));
    json["types"] = Json::array();
    while (words >> word) json["types"].push_back(word);
  }
  if (other != nullptr) json["differs"] = cell.differs;
  if (cell.differs) json["other"] = cell.other.substr(0, cell.other.find(' '));
  return json;
}

/// The page that is asked for, else all; codes without a character only where that differs.
std::string as_json(const std::vector<ChartPage>& pages, const ChartOptions& options, const Codepage& codepage,
                    const Codepage* other) {
  Json json = {{"codepage", codepage.name()}, {"id", codepage.id()}};
  if (other != nullptr) json["other"] = other->name();
  json["pages"] = Json::array();
  const ChartPage* const only = options.lead.empty() ? nullptr : &page_of(pages, options.lead, codepage.name());
  for (const ChartPage& page : pages) {
    if (only != nullptr && only != &page) continue;
    Json row = {{"lead", page.lead == 0 ? "" : hex_text(page.lead, page.lead > 0xFF ? 4 : 2)}};
    if (other != nullptr) row["differences"] = page.differences;
    row["codes"] = Json::array();
    for (const ChartCell& cell : page.cells) {
      if (cell.kind != ChartCell::Kind::kNone || cell.differs) row["codes"].push_back(json_of(cell, other));
    }
    json["pages"].push_back(row);
  }
  return json_text(json);
}

int chart(const ChartOptions& options, const CommonOptions& common) {
  const Session session(common);
  const Codepage codepage(session, options.codepage);
  std::unique_ptr<Codepage> other;
  if (!options.other.empty()) other = std::make_unique<Codepage>(session, options.other);
  const std::vector<ChartPage> pages = chart_pages(codepage, other.get());
  Output output(options.output);
  output.write(options.html   ? as_html(pages, codepage, other.get())
               : options.json ? as_json(pages, options, codepage, other.get())
                              : as_text(pages, options, codepage, other.get()));
  output.commit();
  return kDone;
}

}  // namespace

Run declare_chart(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<ChartOptions>();
  command.add_option("CODEPAGE", options->codepage, "codepage: a name, an identifier or an alias")
      .required()
      .type_name("");
  command.add_option("--other", options->other, "codepage to compare with").type_name("CP");
  const Arguments::Option lead =
      command.add_option("--lead", options->lead, "the page of longer characters that begin with these bytes")
          .type_name("HEX");
  const Arguments::Option types =
      command.add_flag("--types", options->types, "letters for the types in place of the characters");
  const Arguments::Option html = command.add_flag("--html", options->html, "all pages, as one page of HTML")
                                     .excludes(lead)
                                     .excludes(types);
  command.add_flag("--json", options->json, "the codes as JSON: of all pages, or of one")
      .excludes(types)
      .excludes(html);
  command.add_option("-o,--output", options->output, "output file, replaced when it is complete")
      .type_name("OUT");
  command.footer(
      "A row is the first half of the last byte, a column the second one. · stands for no character, » for a "
      "byte that\n"
      "begins longer ones, ⇧ for a shift byte, □ for a control or a private character, ␣ for a blank, * for a "
      "code that\n"
      "the other codepage has something else for. Types: U upper case, L lower case, A another letter, D "
      "digit,\n"
      "P punctuation, S space, C control, O another character.\n"
      "\n"
      "Examples:\n"
      "  lexicor chart IBM930\n"
      "  lexicor chart IBM930 --lead 45\n"
      "  lexicor chart IBM1141 --other IBM273\n"
      "  lexicor chart MS932 --other IBM943 --html -o ms932.html");
  return [options, &common] { return chart(*options, common); };
}

}  // namespace lexicor_cli
