// What every subcommand is made of: its row in the table of main.cpp, the options that all of them share, the
// exit codes, and the error that ends one with a message.
#pragma once

#include <functional>
#include <stdexcept>
#include <string>

namespace lexicor_cli {

class Arguments;

/// The last two are answers of `compare`, whose kDone says that the texts are equal.
enum ExitCode { kDone = 0, kDataError = 1, kUsageError = 2, kLess = 3, kGreater = 4 };

/// Ends the program with a message on standard error and an exit code.
class Failure : public std::runtime_error {
 public:
  Failure(ExitCode code, const std::string& text) : std::runtime_error(text), code_(code) {}
  ExitCode code() const { return code_; }

 private:
  ExitCode code_;
};

/// The program that runs, which its messages begin with.
inline const char* g_program = "lexicor";

/// The options that stand before or behind any subcommand.
struct CommonOptions {
  std::string locale_dir;  // empty: found by Session
};

/// Runs a subcommand whose options have been parsed; returns the exit code.
using Run = std::function<int()>;

/// Declares the subcommand's options. They, and `common`, outlive the Run that comes back.
using Declare = Run (*)(Arguments& command, const CommonOptions& common);

struct Subcommand {
  const char* name;
  const char* summary;
  Declare declare;
};

Run declare_chart(Arguments& command, const CommonOptions& common);
Run declare_compare(Arguments& command, const CommonOptions& common);
Run declare_convert(Arguments& command, const CommonOptions& common);
Run declare_explain(Arguments& command, const CommonOptions& common);
Run declare_format(Arguments& command, const CommonOptions& common);
Run declare_info(Arguments& command, const CommonOptions& common);
Run declare_key(Arguments& command, const CommonOptions& common);
Run declare_lines(Arguments& command, const CommonOptions& common);
Run declare_list(Arguments& command, const CommonOptions& common);
Run declare_map(Arguments& command, const CommonOptions& common);
Run declare_message(Arguments& command, const CommonOptions& common);
Run declare_native(Arguments& command, const CommonOptions& common);
Run declare_parse(Arguments& command, const CommonOptions& common);
Run declare_sort(Arguments& command, const CommonOptions& common);
Run declare_translate(Arguments& command, const CommonOptions& common);

}  // namespace lexicor_cli
