// The command line of a program: what it declares of its arguments, and how they are read. The argument parser behind
// it has a large header, which arguments.cpp alone includes.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace CLI {
class App;
class Option;
}  // namespace CLI

namespace lexicor_cli {

/// The arguments of a program, or of one of its subcommands.
class Arguments {
 public:
  /// One option or positional argument.
  class Option {
   public:
    explicit Option(CLI::Option* option) : option_(option) {}

    const Option& required() const;
    /// What stands for the value in the help; empty: nothing.
    const Option& type_name(const char* name) const;
    const Option& one_of(const std::vector<std::string>& values) const;
    const Option& at_least(int32_t least) const;
    /// For names of files: a variable of a script that is not set leaves an empty one.
    const Option& not_empty() const;
    /// Several values in one argument.
    const Option& divided_by(char delimiter) const;
    /// One value each time that it is given.
    const Option& one_at_a_time() const;
    const Option& needs(const Option& other) const;
    const Option& excludes(const Option& other) const;

   private:
    CLI::Option* option_;
  };

  explicit Arguments(CLI::App& command) : command_(command) {}
  /// For a subcommand: whether it is the one that was named.
  bool given() const;

  /// `name` without a dash: a positional argument. The value keeps what it holds when the argument is not
  /// given.
  Option add_option(const char* name, std::string& value, const char* help);
  Option add_option(const char* name, std::optional<std::string>& value, const char* help);
  Option add_option(const char* name, std::vector<std::string>& values, const char* help);
  Option add_option(const char* name, int32_t& value, const char* help);
  Option add_option(const char* name, uint32_t& value, const char* help);
  Option add_flag(const char* name, bool& value, const char* help);
  /// A flag that may be given as --name=VALUE; alone it has the first of the values.
  Option add_flag(const char* name, std::string& value, const std::vector<std::string>& values,
                  const char* help);
  /// What the help ends with.
  void footer(const char* text);

 private:
  CLI::App& command_;
};

class CommandLine {
 public:
  /// --version prints the version, and --quiet goes with every command.
  CommandLine(const char* program, const char* summary, const char* version);
  ~CommandLine();
  CommandLine(const CommandLine&) = delete;
  CommandLine& operator=(const CommandLine&) = delete;

  /// What may stand before a subcommand or behind it.
  Arguments arguments();
  /// A command line names one of the subcommands, where there are any.
  Arguments add_subcommand(const char* name, const char* summary);
  /// False: a question for help or the version, which is answered. Throws a Failure that names what is wrong.
  bool parse(int argc, char** argv);

 private:
  std::unique_ptr<CLI::App> program_;
};

/// The keys of a map, for one_of().
template <class Map>
std::vector<std::string> keys_of(const Map& map) {
  std::vector<std::string> keys;
  for (const auto& entry : map) keys.push_back(entry.first);
  return keys;
}

}  // namespace lexicor_cli
