// What is wrong with a command line, said by name: the argument parser alone names what it misses first, which
// hides the misspelt argument that was meant for it. Included by main.cpp files only: the header of the
// argument parser is large.
#pragma once

#include <CLI/CLI.hpp>
#include <string>
#include <vector>

#include "near_names.h"

namespace lexicor_cli {

/// The subcommand that was named, with those above it: "lexicor sort".
inline std::string command_text(const CLI::App& app) {
  for (const CLI::App* command : app.get_subcommands()) return app.get_name() + " " + command_text(*command);
  return app.get_name();
}

/// The long names of the options that the named subcommand takes.
inline std::vector<std::string> option_names(const CLI::App& app) {
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

/// The message for a command line that was refused, without the program's name.
inline std::string parse_fault(const CLI::App& app, const CLI::ParseError& error) {
  const std::vector<std::string> left = app.remaining(true);
  const std::string help = "'" + command_text(app) + " --help' shows those there are";
  std::vector<std::string> commands;
  for (const CLI::App* command : app.get_subcommands([](const CLI::App*) { return true; }))
    commands.push_back(command->get_name());
  for (const std::string& argument : left) {
    const bool option = argument.size() > 1 && argument[0] == '-';
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

}  // namespace lexicor_cli
