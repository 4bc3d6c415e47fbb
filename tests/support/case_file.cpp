#include "support/case_file.h"

#include <cstdlib>
#include <fstream>
#include <map>

namespace lx::test {

namespace {

/// Takes a line apart.
class Scanner {
 public:
  Scanner(std::string place, std::string line) : place_(std::move(place)), line_(std::move(line)) {}

  [[noreturn]] void fail(const std::string& what) const { throw CaseError(place_ + ": " + what); }
  bool at_end() {
    while (at_ < line_.size() && line_[at_] == ' ') ++at_;
    return at_ == line_.size();
  }
  bool take(char c) {
    const bool found = at_ < line_.size() && line_[at_] == c;
    at_ += found;
    return found;
  }
  std::string until(const char* ends) {
    const size_t from = at_;
    at_ = std::min(line_.find_first_of(ends, at_), line_.size());
    return line_.substr(from, at_ - from);
  }
  CaseText text() {
    CaseText made;
    while (!take('"')) {
      if (at_ >= line_.size()) fail("a text without an end");
      made.values.push_back(take('\\') ? escape() : character());
    }
    return made;
  }

 private:
  uint32_t escape() {
    static const std::map<char, uint32_t> kEscapes{{'>', CaseText::kShiftOut},
                                                   {'<', CaseText::kShiftIn},
                                                   {'-', CaseText::kNothing},
                                                   {'n', '\n'},
                                                   {'"', '"'},
                                                   {'\\', '\\'}};
    const char c = at_ < line_.size() ? line_[at_++] : '\0';
    if (c == 'x') return CaseText::kByte | hex(2);
    if (c == 'u') return hex(4);
    if (kEscapes.count(c) == 0) fail("an unknown escape");
    return kEscapes.at(c);
  }
  uint32_t hex(size_t digits) {
    const std::string number = line_.substr(std::min(at_, line_.size()), digits);
    if (number.size() < digits || number.find_first_not_of("0123456789ABCDEF") != std::string::npos)
      fail("hexadecimal digits are missing");
    at_ += digits;
    return static_cast<uint32_t>(std::stoul(number, nullptr, 16));
  }
  uint32_t character() {
    const auto byte = [&] { return at_ < line_.size() ? static_cast<uint8_t>(line_[at_++]) : 0u; };
    const uint32_t lead = byte();
    if (lead < 0x80) return lead;
    uint32_t value = lead < 0xE0 ? lead & 0x1F : lead & 0x0F;
    for (int trails = lead < 0xE0 ? 1 : 2; trails > 0; --trails) value = value << 6 | (byte() & 0x3F);
    if (lead < 0xC2 || lead > 0xEF) fail("no UTF-8 of a 16-bit value");
    return value;
  }

  std::string place_, line_;
  size_t at_ = 0;
};

CaseWords::Word next_word(Scanner& line) {
  CaseWords::Word word;
  if (!line.take('"')) {
    word.name = line.until(" =");
    if (word.name.empty() || !line.take('=')) return word;
    if (!line.take('"')) return word.value = line.until(" "), word;
  }
  word.text = line.text();
  word.quoted = true;
  return word;
}

Case read_case(const std::string& place, const std::string& text) {
  Scanner line(place, text);
  Case made;
  made.place = place;
  if (line.take('[')) {
    while (!line.take(']')) {
      if (line.at_end()) line.fail("marks without an end");
      made.marks.push_back(line.until(" ]"));
      line.take(' ');
    }
    line.at_end();
  }
  made.family = line.until(" ");
  CaseWords* words = &made.given;
  while (!line.at_end()) {
    if (line.take('='))
      words = &made.expected;
    else
      words->all.push_back(next_word(line));
  }
  if (made.family != "with" && words == &made.given) line.fail("a case without a result");
  return made;
}

}  // namespace

bool CaseText::raw() const {
  return std::any_of(values.begin(), values.end(), [](uint32_t v) { return v >= kByte; });
}
std::string CaseText::bytes(const TinyCodepage& cp) const {
  std::string made;
  for (const uint32_t v : values)
    if (v == kNothing)
      continue;
    else if (v == kShiftOut || v == kShiftIn)
      made += v == kShiftOut ? cp.shift_out : cp.shift_in;
    else
      made += v >= kByte ? std::string(1, static_cast<char>(v)) : cp.find(static_cast<uint16_t>(v))->bytes;
  return made;
}
bool CaseText::in(const TinyCodepage& cp) const {
  return std::all_of(values.begin(), values.end(), [&](uint32_t v) {
    if (v < kByte) return v == 0xFFFD || cp.find(static_cast<uint16_t>(v)) != nullptr;
    return cp.shift || (v != kShiftOut && v != kShiftIn);
  });
}

const CaseWords::Word* CaseWords::find(const std::string& name, bool quoted) const {
  for (const Word& w : all)
    if (!w.used && w.quoted == quoted && w.name == name) return w.used = true, &w;
  return nullptr;
}
bool CaseWords::has_text(const std::string& name) const {
  return std::any_of(all.begin(), all.end(),
                     [&](const Word& w) { return !w.used && w.quoted && w.name == name; });
}
const CaseText& CaseWords::text(const std::string& name) const {
  const Word* const found = find(name, true);
  if (found == nullptr) throw CaseError("a text is missing: " + name);
  return found->text;
}
std::string CaseWords::word() const {
  for (const Word& w : all)
    if (!w.used && !w.quoted && w.value.empty()) return w.used = true, w.name;
  throw CaseError("a word is missing");
}
int32_t CaseWords::number(const std::string& name, int32_t otherwise) const {
  const Word* const found = find(name, false);
  return found != nullptr ? static_cast<int32_t>(std::strtoll(found->value.c_str(), nullptr, 0)) : otherwise;
}
std::string CaseWords::unused() const {
  std::string names;
  for (const Word& w : all)
    if (!w.used) names += " " + (w.quoted ? w.name + "\"" + shown(w.text.units()) + "\"" : w.name);
  return names;
}
void CaseWords::reset() const {
  for (const Word& w : all) w.used = false;
}

std::vector<Case> read_cases(const std::string& path) {
  std::ifstream file(path);
  if (!file) throw CaseError(path + ": cannot be read");
  const std::string name = path.substr(path.rfind('/') + 1);
  std::vector<std::pair<int, std::string>> lines;
  int number = 0;
  for (std::string line; std::getline(file, line);) {
    ++number;
    if (!line.empty() && line[0] == '#') continue;
    if (!line.empty() && line[0] == ' ' && !lines.empty())
      lines.back().second += line.substr(line.find_first_not_of(' ') - 1);
    else
      lines.emplace_back(number, line);
  }
  std::vector<Case> cases;
  std::vector<CaseWords> with;
  for (const auto& [at, line] : lines) {
    if (line.empty()) {
      with.clear();
      continue;
    }
    Case made = read_case(name + ":" + std::to_string(at), line);
    if (made.family == "with") {
      with.push_back(made.given);
      continue;
    }
    made.with = with;
    cases.push_back(std::move(made));
  }
  return cases;
}

}  // namespace lx::test
