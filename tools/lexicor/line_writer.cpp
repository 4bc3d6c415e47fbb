// Lines of the same bytes are equal in the order too, so that they stand among equal ones.
#include "line_writer.h"

namespace lexicor_cli {

bool LineWriter::is_new(const Line& line, std::string_view key) {
  const bool equal = has_last_ && order_.compare(last_, key) == 0;
  if (!equal) {
    last_ = key;
    has_last_ = true;
    // An order that is no order of keys may contradict itself.
    if (order_.by_key()) written_.clear();
  }
  if (unique_ == Unique::kOrder) return !equal;
  return written_.insert(std::string(line.whole())).second;
}

}  // namespace lexicor_cli
