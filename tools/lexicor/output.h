// Where a subcommand writes: standard output, or a file that appears under its name only when it is complete.
#pragma once

#include <string>

namespace lexicor_cli {

/// Thrown when the reader of a pipe has gone away: the program ends quietly.
struct BrokenPipe {};

/// What takes a text that is written.
class Sink {
 public:
  Sink() = default;
  virtual ~Sink() = default;
  Sink(const Sink&) = delete;
  Sink& operator=(const Sink&) = delete;

  virtual void write(const char* data, size_t bytes) = 0;
  void write(const std::string& text) { write(text.data(), text.size()); }
};

class Output : public Sink {
 public:
  /// "-" is standard output. A regular file, and one that does not exist, is written beside
  /// under a temporary name; anything else (a device, a named pipe, an open descriptor such as /dev/stdout) is
  /// written directly. Symbolic links are followed, also to a file that does not exist yet. Throws a Failure.
  explicit Output(const std::string& path = "-");
  /// Without commit() the temporary file is removed.
  ~Output() override;

  using Sink::write;
  void write(const char* data, size_t bytes) override;
  /// Closes the file and gives it its name.
  void commit();
  bool is_terminal() const;

 private:
  [[noreturn]] void fail() const;

  int fd_ = -1;
  std::string path_;       // for messages: the name as the user gave it
  std::string target_;     // the file to replace, symbolic links followed
  std::string temporary_;  // empty: written directly
  int guard_ = -1;         // of the temporary file against signals
};

}  // namespace lexicor_cli
