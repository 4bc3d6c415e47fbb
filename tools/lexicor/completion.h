// What can stand next on a command line: `PROGRAM --complete WORD...` writes it for the shells in completions/, a line a
// word, nothing where a file is expected. What is declared of the arguments is all that it knows of them.
#pragma once

#include <string>
#include <vector>

namespace CLI {
class App;
}

namespace lexicor_cli {

constexpr char kCompleteOption[] = "--complete";

/// The words that the last of `words` may become. Names of codepages and locales come from the locale directory that the
/// command line means, in any letter case.
std::vector<std::string> completions(const CLI::App& program, const std::vector<std::string>& words);

}  // namespace lexicor_cli
