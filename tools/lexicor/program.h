// What the main functions of the command-line programs share: how a program answers a wrong command line, and
// how it ends. Included by main.cpp files only: the header of the argument parser is large.
#pragma once

#include <CLI/CLI.hpp>
#include <csignal>
#include <iostream>
#include <new>
#include <sstream>
#include <string>

#include "command.h"
#include "descriptors.h"
#include "output.h"
#include "parse_fault.h"

namespace lexicor_cli {

/// A question for help or the version: prints it and returns the exit code. Throws a Failure for a wrong
/// command line.
inline int answer_parse(const CLI::App& app, const CLI::ParseError& error) {
  std::ostringstream out, err;
  if (app.exit(error, out, err) != 0) throw Failure(kUsageError, parse_fault(app, error));
  std::string text = out.str();
  if (!text.empty() && text.back() != '\n') text += '\n';
  Output().write(text);
  return kDone;
}

/// Runs the program; what it throws becomes a message and an exit code.
inline int run_program(const char* name, int (*run)(int, char**), int argc, char** argv) {
  open_closed_descriptors();
  g_program = name;
  std::signal(SIGPIPE, SIG_IGN);
  try {
    return run(argc, argv);
  } catch (const Failure& failure) {
    std::cerr << name << ": " << failure.what() << '\n';
    return failure.code();
  } catch (const BrokenPipe&) {
    // Ends as a program does that a closed pipe kills, also where the signal was ignored from the start.
    return 128 + SIGPIPE;
  } catch (const std::bad_alloc&) {
    std::cerr << name << ": out of memory\n";
    return kDataError;
  }
}

}  // namespace lexicor_cli
