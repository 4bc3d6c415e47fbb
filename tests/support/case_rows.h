// Cases in text files beside the tests: a line is a row of fields between bars. Blanks around a field do not
// count, nor do lines that begin with # and empty ones. \xNN is a byte, and \x20 a blank that counts; {32n} is
// n, 32 times.
#pragma once

#include <fstream>
#include <stdexcept>
#include <string>
#include <vector>

namespace lx::test {

struct CaseRow {
  std::string where;  // file and line
  std::vector<std::string> fields;

  const std::string& operator[](size_t i) const { return fields.at(i); }
  int32_t number(size_t i) const { return static_cast<int32_t>(std::stoll(fields.at(i), nullptr, 0)); }
};

inline std::string case_field(const std::string& text) {
  const size_t begin = text.find_first_not_of(' ');
  if (begin == std::string::npos) return "";
  std::string bytes;
  for (size_t i = begin; i <= text.find_last_not_of(' '); ++i) {
    if (text.compare(i, 2, "\\x") == 0) {
      bytes += static_cast<char>(std::stoi(text.substr(i + 2, 2), nullptr, 16));
      i += 3;
    } else if (text[i] == '{') {
      const size_t end = text.find('}', i);
      bytes.append(std::stoul(text.substr(i + 1)), text[end - 1]);
      i = end;
    } else {
      bytes += text[i];
    }
  }
  return bytes;
}

/// The rows of tests/NAME.
inline std::vector<CaseRow> case_rows(const std::string& name) {
  std::ifstream file(LEXICOR_DATA_DIR "/../tests/" + name);
  std::vector<CaseRow> rows;
  std::string line;
  for (int number = 1; std::getline(file, line); ++number) {
    if (line.empty() || line[0] == '#') continue;
    CaseRow row{name + ":" + std::to_string(number), {}};
    for (size_t begin = 0; begin <= line.size();) {
      const size_t end = std::min(line.find('|', begin), line.size());
      row.fields.push_back(case_field(line.substr(begin, end - begin)));
      begin = end + 1;
    }
    rows.push_back(row);
  }
  if (rows.empty()) throw std::runtime_error("no cases in " + name);
  return rows;
}

}  // namespace lx::test
