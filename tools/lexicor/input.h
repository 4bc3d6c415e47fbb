// The input of a subcommand: files and standard input, one behind the other, as one text.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "command.h"

namespace lexicor_cli {

/// A place in the input, for a message.
struct InputPlace {
  std::string file;                // empty: there is only one
  uint64_t byte;                   // in its file
  uint64_t line = 0, column = 0;   // 0: not known
  const char* line_name = "line";  // what is counted by lines

  /// "FILE, line 2, column 5 (byte 12)", or "byte 12".
  std::string text() const;
};

class Input {
 public:
  /// No names, or "-", is standard input. Places name their file where there are several, or where `one_of_several`
  /// says that there are others beside this input.
  explicit Input(std::vector<std::string> names, bool one_of_several = false);
  ~Input();
  Input(const Input&) = delete;
  Input& operator=(const Input&) = delete;

  /// Reads until `bytes` bytes are there or a file ends; 0 at the end of the input. Throws a Failure with the
  /// file's name and the reason.
  size_t read(char* buffer, size_t bytes);

  /// Where the files that have been opened begin in the whole text.
  std::vector<uint64_t> starts() const;
  /// Whether one of them begins at a byte of the whole text.
  bool begins_file(uint64_t offset) const;

  /// The size of all files together; 0 when one of them is no regular file.
  uint64_t total_bytes() const;

  /// Where a byte of the whole text stands.
  InputPlace place(uint64_t offset) const;
  std::string locate(uint64_t offset) const { return place(offset).text(); }
  /// What to throw when the input ended inside the character that begins there.
  Failure cut_at(uint64_t offset) const;

 private:
  struct Start {
    uint64_t offset;  // in the whole text
    size_t file;
  };

  /// Opens the next file; false when there is none left.
  bool open_next();
  Start start_before(uint64_t offset) const;
  [[noreturn]] void fail(size_t file) const;
  std::string title(size_t file) const;

  std::vector<std::string> names_;
  const bool names_files_;
  size_t next_file_ = 0;
  int fd_ = -1;
  uint64_t offset_ = 0;
  std::vector<Start> starts_;
};

}  // namespace lexicor_cli
