// What the readers of both source formats share: the line that is read, a place in it, and where faults and
// messages go.
#pragma once

#include <algorithm>
#include <string>
#include <vector>

#include "builder.h"
#include "encoding.h"
#include "problems.h"

namespace lexicor_gencat {

class SourceParser {
 public:
  SourceParser(const std::string& source, const std::string& file_name, const Recoder& recoder,
               CatalogBuilder& builder, Problems& problems)
      : reader_(recoder.source(), source),
        file_name_(file_name),
        recoder_(recoder),
        builder_(builder),
        problems_(problems) {}

 protected:
  bool at_end() const { return at_ >= line_.size(); }
  uint32_t peek() const { return at_end() ? Character::kNone : line_[at_].syntax; }
  template <class Is>
  void skip(Is is) {
    while (!at_end() && is(peek())) ++at_;
  }

  /// Of a character of the line, or behind its last one.
  Place place(size_t at) const {
    if (line_.empty()) return {file_name_, reader_.line_number(), 1};
    const Character& c = line_[std::min(at, line_.size() - 1)];
    return {file_name_, c.line, c.column + (at < line_.size() ? 0 : 1)};
  }
  void error(size_t at, const std::string& text) { problems_.error(place(at), text); }

  LineReader reader_;
  const std::string& file_name_;
  const Recoder& recoder_;
  CatalogBuilder& builder_;
  Problems& problems_;
  std::vector<Character> line_;
  size_t at_ = 0;
};

}  // namespace lexicor_gencat
