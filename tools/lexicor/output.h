// Where a subcommand writes: standard output, or a file that appears under its name only when it is complete.
#pragma once

#include <string>

namespace lexicor_cli {

/// Thrown when the reader of a pipe has gone away: the program ends quietly.
struct BrokenPipe {};

class Output {
 public:
  /// An empty path or "-" is standard output. A regular file, and one that does not exist, is written beside
  /// under a temporary name; anything else (a device, a named pipe, an open descriptor such as /dev/stdout) is
  /// written directly. Symbolic links are followed, also to a file that does not exist yet. Throws a Failure.
  explicit Output(const std::string& path = "");
  /// Without commit() the temporary file is removed.
  ~Output();
  Output(const Output&) = delete;
  Output& operator=(const Output&) = delete;

  void write(const char* data, size_t bytes);
  void write(const std::string& text) { write(text.data(), text.size()); }
  /// Closes the file and gives it its name.
  void commit();
  bool is_terminal() const;

 private:
  [[noreturn]] void fail() const;

  int fd_ = -1;
  std::string path_;       // for messages: the name as the user gave it
  std::string target_;     // the file to replace, symbolic links followed
  std::string temporary_;  // empty: written directly
};

}  // namespace lexicor_cli
