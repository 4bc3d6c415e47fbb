// Hands declarations on to the argument parser, and says what it refuses.
#include "arguments.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <limits>
#include <sstream>

#include "command.h"
#include "completion.h"
#include "near_names.h"
#include "notices.h"
#include "output.h"

namespace lexicor_cli {
namespace {

/// The subcommand that was named, with those above it: "lexicor sort".
std::string command_text(const CLI::App& app) {
  for (const CLI::App* command : app.get_subcommands()) return app.get_name() + " " + command_text(*command);
  return app.get_name();
}

/// The long names of the options that the named subcommand takes.
std::vector<std::string> option_names(const CLI::App& app) {
  std::vector<std::string> names;
  for (const CLI::App* at = &app; at != nullptr;) {
    for (const CLI::Option* option : at->get_options()) {
      for (const std::string& name : option->get_lnames()) names.push_back("--" + name);
    }
    const std::vector<CLI::App*> below = at->get_subcommands();
    at = below.empty() ? nullptr : below[0];
  }
  return names;
}

/// What is wrong with a command line, said by name: the parser alone names what it misses first, which hides the
/// misspelt argument that was meant for it.
std::string parse_fault(const CLI::App& app, const CLI::ParseError& error,
                        const std::vector<std::string>& arguments) {
  const auto dashes = std::find(arguments.begin(), arguments.end(), "--");
  const std::vector<std::string> left = app.remaining(true);
  const std::string help = "'" + command_text(app) + " --help' shows those there are";
  std::vector<std::string> commands;
  for (const CLI::App* command : app.get_subcommands([](const CLI::App*) { return true; }))
    commands.push_back(command->get_name());
  for (const std::string& argument : left) {
    const bool option = argument.size() > 1 && argument[0] == '-';
    if (option && std::find(arguments.begin(), dashes, argument) == dashes)
      return "unexpected argument '" + argument + "': behind -- nothing is an option";
    const bool command = !option && !commands.empty() && app.get_subcommands().empty();
    if (!option && !command) continue;
    const std::string name = argument.substr(0, argument.find('='));
    const std::string near = did_you_mean(nearest_name(name, option ? option_names(app) : commands));
    return (option ? "unknown option " + name : "unknown command '" + name + "'") +
           (near.empty() ? "; " + help : near);
  }
  if (!left.empty())
    return "unexpected argument '" + left[0] + "'; '" + command_text(app) + " --help' says more";
  return std::string(error.what()) + "; '" + command_text(app) + " --help' says more";
}

}  // namespace

using Option = Arguments::Option;

const Option& Option::required() const {
  option_->required();
  return *this;
}
const Option& Option::type_name(const char* name) const {
  option_->type_name(name);
  return *this;
}
const Option& Option::one_of(const std::vector<std::string>& values) const {
  option_->check(CLI::IsMember(values));
  return *this;
}
const Option& Option::at_least(int32_t least) const {
  option_->check(CLI::Range(least, std::numeric_limits<int32_t>::max()));
  return *this;
}
const Option& Option::not_empty() const {
  option_->check([](const std::string& value) { return value.empty() ? "the name is empty" : ""; }, "");
  return *this;
}
const Option& Option::divided_by(char delimiter) const {
  option_->delimiter(delimiter)->allow_extra_args(false);
  return *this;
}
const Option& Option::one_at_a_time() const {
  option_->allow_extra_args(false);
  return *this;
}
const Option& Option::needs(const Option& other) const {
  option_->needs(other.option_);
  return *this;
}
const Option& Option::excludes(const Option& other) const {
  option_->excludes(other.option_);
  return *this;
}

Option Arguments::add_option(const char* name, std::string& value, const char* help) {
  return Option(command_.add_option(name, value, help));
}
Option Arguments::add_option(const char* name, std::optional<std::string>& value, const char* help) {
  return Option(command_.add_option(name, value, help));
}
Option Arguments::add_option(const char* name, std::vector<std::string>& values, const char* help) {
  CLI::Option* const option = command_.add_option(name, values, help);
  // Where it allows more values than it expects, the parser takes a value in brackets apart: [a] would be a. So it
  // expects as many as there can be, and takes those there are.
  constexpr int kMost = CLI::detail::expected_max_vector_size;
  if (option->get_positional())
    option->expected(kMost, kMost)
        ->allow_extra_args(false)
        ->multi_option_policy(CLI::MultiOptionPolicy::TakeAll);
  return Option(option);
}
Option Arguments::add_option(const char* name, int32_t& value, const char* help) {
  return Option(command_.add_option(name, value, help));
}
Option Arguments::add_option(const char* name, uint32_t& value, const char* help) {
  return Option(command_.add_option(name, value, help));
}
Option Arguments::add_flag(const char* name, bool& value, const char* help) {
  return Option(command_.add_flag(name, value, help));
}
Option Arguments::add_flag(const char* name, std::string& value, const std::vector<std::string>& values,
                           const char* help) {
  CLI::Option* const flag = command_.add_flag(std::string(name) + "{" + values[0] + "}", value, help);
  flag->check(CLI::IsMember(values));
  return Option(flag);
}

void Arguments::footer(const char* text) {
  command_.footer(text);
}

bool Arguments::given() const {
  return static_cast<bool>(command_);
}

CommandLine::CommandLine(const char* program, const char* summary, const char* version)
    : program_(std::make_unique<CLI::App>(summary, program)) {
  program_->set_version_flag("--version", std::string(program) + " " + version);
  program_->add_flag("-q,--quiet", g_quiet,
                     "say nothing on standard error but errors, and JSON that is asked for");
}
CommandLine::~CommandLine() = default;

Arguments CommandLine::arguments() {
  return Arguments(*program_);
}

Arguments CommandLine::add_subcommand(const char* name, const char* summary) {
  program_->require_subcommand(1);
  return Arguments(*program_->add_subcommand(name, summary)->fallthrough());
}

bool CommandLine::parse(int argc, char** argv) {
  if (argc > 1 && std::string(argv[1]) == kCompleteOption) {
    std::string lines;
    for (const std::string& word : completions(*program_, {argv + 2, argv + argc})) lines += word + '\n';
    Output().write(lines);
    return false;
  }
  try {
    program_->parse(argc, argv);
    return true;
  } catch (const CLI::ParseError& error) {
    std::ostringstream out, err;
    if (program_->exit(error, out, err) != 0)
      throw Failure(kUsageError, parse_fault(*program_, error, {argv + 1, argv + argc}));
    std::string text = out.str();
    if (!text.empty() && text.back() != '\n') text += '\n';
    Output().write(text);
    return false;
  }
}

}  // namespace lexicor_cli
