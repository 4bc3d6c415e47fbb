// The library in use: finds the locale directory, calls LXInit and, at the end, LXTerm.
#pragma once

#include <string>

#include "command.h"

namespace lexicor_cli {

class Session {
 public:
  /// Throws a Failure when the library cannot be initialised or the directory that was named holds no control
  /// file. Where no directory is found at all it says so on standard error and goes on with the built-in
  /// objects.
  explicit Session(const CommonOptions& common);
  ~Session();
  Session(const Session&) = delete;
  Session& operator=(const Session&) = delete;

  /// Whether the built-in objects are all there is.
  bool built_in_only() const { return built_in_only_; }

 private:
  bool built_in_only_ = false;
};

/// The locale directory of the session.
std::string session_directory();

/// What a return code of the library means.
std::string describe_code(int code);

/// "sort Default cannot be loaded: file not found (code 1000): DIR/so_00001.nls". `title` names the type.
std::string load_problem(int type, const std::string& title, const std::string& name, int code);

}  // namespace lexicor_cli
