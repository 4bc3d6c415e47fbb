// Writers of codepage tables: the plain form, and the short one of checked-in sources.
#include <algorithm>
#include <ostream>
#include <set>
#include <tuple>

#include "lexicor/hex.h"
#include "ucm.h"
#include "ucm_classes.h"
#include "ucm_line.h"

namespace lexicor_data {
namespace {

using lexicor_cli::hex_text;

constexpr uint8_t kTakenBack = 0xFF;  // as a precision: a mapping of the base that does not hold
constexpr size_t kShortestRange = 3;

std::string in_quotes(const std::string& text) {
  if (text.find_first_of("\"\r\n") != std::string::npos) {
    throw SourceError("", 0, 0, "a text with quotes or line ends cannot be written");
  }
  return '"' + text + '"';
}

std::string leads_text(const std::array<uint8_t, 256>& leads) {
  std::string text;
  for (uint32_t first = 0; first < 256;) {
    uint32_t last = first;
    while (last < 255 && leads[last + 1] == leads[first]) ++last;
    if (leads[first] != 1) {
      if (!text.empty()) text += ' ';
      text += hex_text(first, 2);
      if (last > first) text += '-' + hex_text(last, 2);
      text += ':' + std::to_string(leads[first]);
    }
    first = last + 1;
  }
  return text;
}

/// Writes a key with its value, unless the base says the same.
class HeaderWriter {
 public:
  HeaderWriter(std::ostream& out, const CodepageSource& source, const CodepageSource* base)
      : out_(out), source_(source), base_(base) {}

  void write() {
    key("code_set_name", in_quotes(source_.name));
    if (base_ != nullptr) key("base", in_quotes(base_->name));
    if (!source_.source.empty()) key("lexicor:source", in_quotes(source_.source));
    if (differs(&CodepageSource::kind)) key("uconv_class", in_quotes(class_word(source_.kind)));
    if (differs(&CodepageSource::width)) key("mb_cur_max", std::to_string(source_.width));
    if (differs(&CodepageSource::substitution)) key("subchar", byte_text(source_.substitution));
    if (differs(&CodepageSource::line_ends)) key("lexicor:line_ends", code_text_of(source_.line_ends));
    if (differs(&CodepageSource::ascii)) key("lexicor:ascii", source_.ascii ? "yes" : "no");
    if (source_.kind == CodepageClass::kMultiByte && differs(&CodepageSource::leads))
      key("lexicor:leads", leads_text(source_.leads));
    if (source_.utf8) key("lexicor:algorithm", in_quotes("UTF-8"));
  }

 private:
  template <class Field>
  bool differs(Field CodepageSource::*field) const {
    return base_ == nullptr || !(source_.*field == base_->*field);
  }
  void key(const char* name, const std::string& value) {
    std::string text = "<" + std::string(name) + ">";
    text.resize(std::max<size_t>(text.size() + 1, 22), ' ');
    out_ << text << value << '\n';
  }
  static std::string code_text_of(const std::array<uint8_t, 4>& bytes) {
    std::string text;
    for (uint8_t byte : bytes) text += byte_text(byte);
    return text;
  }

  std::ostream& out_;
  const CodepageSource& source_;
  const CodepageSource* base_;
};

/// The lines of a source on a base: the mappings that the base does not have, and those of the base that neither
/// hold nor contradict a mapping that does.
std::vector<Mapping> difference(const CodepageSource& source, const CodepageSource& base) {
  const auto key = [](const Mapping& m) { return std::make_tuple(m.unicode, m.precision, m.code); };
  std::set<std::tuple<uint32_t, uint8_t, uint32_t>> in_source, in_base;
  for (const Mapping& m : source.mappings) in_source.insert(key(m));
  for (const Mapping& m : base.mappings) in_base.insert(key(m));
  std::vector<Mapping> lines;
  std::set<uint32_t> values, codes;
  for (const Mapping& m : source.mappings) {
    if (in_base.count(key(m)) != 0) continue;
    lines.push_back(m);
    if (from_unicode(m)) values.insert(m.unicode);
    if (to_unicode(m)) codes.insert(m.code);
  }
  for (Mapping m : base.mappings) {
    const bool contradicted =
        (from_unicode(m) && values.count(m.unicode) != 0) || (to_unicode(m) && codes.count(m.code) != 0);
    if (contradicted || in_source.count(key(m)) != 0) continue;
    m.precision = kTakenBack;
    lines.push_back(m);
  }
  return lines;
}

/// How many of the lines from `at` on are characters in a row that one range can name.
size_t length_of_range(const std::vector<Mapping>& lines, size_t at) {
  size_t end = at + 1;
  for (; end < lines.size(); ++end) {
    const Mapping &last = lines[end - 1], &next = lines[end];
    if (next.unicode != last.unicode + 1 || next.code != last.code + 1 || (next.code & 0xFF) == 0 ||
        next.bytes != last.bytes || next.precision != last.precision)
      break;
  }
  return end - at >= kShortestRange ? end - at : 1;
}

void write_mappings(std::ostream& out, std::vector<Mapping> lines, bool ranges) {
  std::sort(lines.begin(), lines.end(), in_table_order);
  out << "CHARMAP\n";
  for (size_t i = 0; i < lines.size();) {
    const Mapping& first = lines[i];
    const size_t count = ranges ? length_of_range(lines, i) : 1;
    out << unicode_text(first.unicode);
    if (count > 1) out << ".." << unicode_text(lines[i + count - 1].unicode);
    out << ' ' << code_text(first.code, first.bytes) << " |"
        << (first.precision == kTakenBack ? '-' : static_cast<char>('0' + first.precision)) << '\n';
    i += count;
  }
  out << "END CHARMAP\n";
}

}  // namespace

void write_ucm(std::ostream& out, const CodepageSource& source) {
  HeaderWriter(out, source, nullptr).write();
  if (!source.utf8) write_mappings(out, source.mappings, false);
}

void write_ucm_source(std::ostream& out, const CodepageSource& source, const CodepageSource* base) {
  HeaderWriter(out, source, base).write();
  if (!source.utf8) write_mappings(out, base == nullptr ? source.mappings : difference(source, *base), true);
}

}  // namespace lexicor_data
