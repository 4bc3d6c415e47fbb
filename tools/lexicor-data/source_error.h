// What is wrong with a source, and where. A reader goes on behind an error where it can, so that one run says all
// that is to be mended.
#pragma once

#include <stdexcept>
#include <string>
#include <vector>

namespace lexicor_data {

/// An error in a source: what, in which file, and where in it (1-based; 0: not known).
struct SourceError : std::runtime_error {
  SourceError(std::string file_name, int line_number, int column_number, const std::string& what);
  std::string file;
  int line;
  int column;
  std::string fault;                 ///< what() without the place
  std::vector<SourceError> further;  ///< the other errors of the same step; they have no further ones

  /// This error and the further ones.
  std::vector<SourceError> all() const;
};

/// Collects the errors of steps that do not need each other.
class SourceErrors {
 public:
  /// Enough of one file: what follows is mostly of the same kind.
  static constexpr size_t kMostOfFile = 20;

  /// Runs a step; false when it threw a SourceError, which is kept.
  template <class Step>
  bool attempt(Step&& step) {
    try {
      step();
      return true;
    } catch (const SourceError& error) {
      add(error);
      return false;
    }
  }
  void add(const SourceError& error);
  void add_all(const SourceErrors& errors);
  bool empty() const { return list_.empty(); }
  bool full() const { return list_.size() >= kMostOfFile; }
  const std::vector<SourceError>& list() const { return list_; }
  /// Puts errors in the order of their places; those of other files than this come last.
  void sort(const std::string& file);
  /// Throws what was collected, as one error that carries the others.
  void throw_if_any() const;

 private:
  std::vector<SourceError> list_;
};

}  // namespace lexicor_data
