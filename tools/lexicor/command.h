// What every subcommand is made of: its row in the table of main.cpp, the options that all of them share, the
// exit codes, and the error that ends one with a message.
#pragma once

#include <functional>
#include <stdexcept>
#include <string>

// The header of the argument parser is large: only who declares options includes it.
namespace CLI {
class App;
}

namespace lexicor_cli {

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

/// The options that stand before or behind any subcommand.
struct CommonOptions {
  std::string locale_dir;  // empty: found by Session
};

/// Runs a subcommand whose options have been parsed; returns the exit code.
using Run = std::function<int()>;

/// Declares the subcommand's options. They, and `common`, outlive the Run that comes back.
using Declare = Run (*)(CLI::App& command, const CommonOptions& common);

struct Subcommand {
  const char* name;
  const char* summary;
  Declare declare;
};

Run declare_compare(CLI::App& command, const CommonOptions& common);
Run declare_convert(CLI::App& command, const CommonOptions& common);
Run declare_explain(CLI::App& command, const CommonOptions& common);
Run declare_format(CLI::App& command, const CommonOptions& common);
Run declare_info(CLI::App& command, const CommonOptions& common);
Run declare_key(CLI::App& command, const CommonOptions& common);
Run declare_lines(CLI::App& command, const CommonOptions& common);
Run declare_list(CLI::App& command, const CommonOptions& common);
Run declare_map(CLI::App& command, const CommonOptions& common);
Run declare_message(CLI::App& command, const CommonOptions& common);
Run declare_native(CLI::App& command, const CommonOptions& common);
Run declare_parse(CLI::App& command, const CommonOptions& common);
Run declare_sort(CLI::App& command, const CommonOptions& common);
Run declare_translate(CLI::App& command, const CommonOptions& common);

}  // namespace lexicor_cli
