// How the command-line programs end.
#pragma once

#include <csignal>
#include <exception>
#include <iostream>
#include <new>

#include "command.h"
#include "descriptors.h"
#include "output.h"

namespace lexicor_cli {

/// Runs the program; what it throws becomes a message and an exit code.
inline int run_program(const char* name, int (*run)(int, char**), int argc, char** argv) {
  open_closed_descriptors();
  g_program = name;
  std::signal(SIGPIPE, SIG_IGN);
  std::signal(SIGXFSZ, SIG_IGN);
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
  } catch (const std::exception& error) {
    std::cerr << name << ": " << error.what() << '\n';
    return kDataError;
  }
}

}  // namespace lexicor_cli
