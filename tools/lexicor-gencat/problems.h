// The errors and warnings of sources, with their places: a source is read to its end, so that all of them come
// out at once.
#pragma once

#include <cstddef>
#include <string>
#include <vector>

namespace lexicor_gencat {

/// Lines and columns count from 1; columns count characters.
struct Place {
  std::string file;
  int line = 0;
  int column = 0;
};

std::string place_text(const Place& place);

class Problems {
 public:
  /// Without warnings only errors are kept.
  explicit Problems(bool warnings = true) : warnings_(warnings) {}

  /// More errors of a file than this are counted, not listed, and no more warnings than they leave room for.
  static constexpr size_t kListed = 20;

  void error(const Place& place, const std::string& text);
  void warning(const Place& place, const std::string& text);

  size_t errors() const { return errors_; }
  /// The listed messages, a line each, in the order in which they were found; warnings make room for errors.
  std::vector<std::string> lines() const;

 private:
  struct Message {
    bool error;
    std::string line;
  };
  struct File {
    std::string name;
    std::vector<Message> listed;
    size_t unlisted = 0;
  };

  void add(const Place& place, bool error, const std::string& text);

  bool warnings_;
  std::vector<File> files_;
  size_t errors_ = 0;
};

}  // namespace lexicor_gencat
