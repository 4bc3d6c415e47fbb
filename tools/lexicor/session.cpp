// The order in which the locale directory is looked for: the option, the environment variable, the places
// beside the program, the library's own default.
#include "session.h"

#include <lx.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <iostream>
#include <vector>

namespace lexicor_cli {

namespace {

namespace fs = std::filesystem;

constexpr char kDirectoryVariable[] = "LX_LOCALEDIR";
constexpr char kHowToName[] =
    "lexicor: name a locale directory with --locale-dir DIR or the environment variable LX_LOCALEDIR";

std::string control_file_of(const std::string& directory) {
  std::vector<char> name(directory.size() + 32);
  LXGetControlFileName(directory.c_str(), name.data(), static_cast<int32_t>(name.size()));
  return name.data();
}

bool has_control_file(const std::string& directory) {
  return access(control_file_of(directory).c_str(), R_OK) == 0;
}

/// The directory to give to LXInit; empty lets the library look for itself.
std::string choose_directory(const std::string& named) {
  if (!named.empty()) {
    if (!has_control_file(named)) {
      const std::string reason = std::strerror(errno);
      throw Failure(kDataError, control_file_of(named) + ": " + reason);
    }
    return named;
  }
  if (std::getenv(kDirectoryVariable) != nullptr) return {};
  std::error_code error;
  const fs::path program = fs::read_symlink("/proc/self/exe", error);
  if (error) return {};
  const fs::path above = program.parent_path().parent_path();
  for (const char* place : {"locale", "share/lexicor/locale"}) {
    const std::string directory = (above / place).string();
    if (has_control_file(directory)) return directory;
  }
  return {};
}

/// Why no control file could be used: LXInit says only that it was so.
int reason_of_defaults(const char* directory) {
  int32_t code = LX_OK;
  LXObjManager* manager = LXInitObjManager(directory, 0, &code);
  if (manager != nullptr) LXTermObjManager(manager);
  return code;
}

}  // namespace

std::string describe_code(int code) {
  static const struct {
    int code;
    const char* text;
  } kTexts[] = {{LX_E_OPEN, "the file cannot be opened"},
                {LX_E_NOT_INITIALIZED, "the library is not initialised"},
                {LX_E_MEMORY, "out of memory"},
                {LX_E_NO_CODEPAGE, "codepage not found"},
                {LX_E_NO_LANGUAGE, "language not found"},
                {LX_E_NO_SORT, "sort not found"},
                {LX_E_NO_TERRITORY, "territory not found"},
                {LX_E_NOT_FOUND, "object not found"},
                {LX_E_FILE_NOT_FOUND, "file not found"},
                {LX_E_FILE_ACCESS, "permission denied"},
                {LX_E_FILE_IO, "the file cannot be read, or its name is too long"},
                {LX_E_CORRUPT, "the file is damaged or not of this kind"}};
  for (const auto& row : kTexts) {
    if (row.code == code) return row.text;
  }
  return "error " + std::to_string(code);
}

Session::Session(const CommonOptions& common) {
  const std::string directory = choose_directory(common.locale_dir);
  const char* const argument = directory.empty() ? nullptr : directory.c_str();
  const int32_t code = LXInit(argument, nullptr, nullptr, nullptr, 0);
  if (code != LX_OK && code != LX_W_DEFAULTS)
    throw Failure(kDataError, "the library cannot start: " + describe_code(code));
  built_in_only_ = code == LX_W_DEFAULTS;
  if (!built_in_only_) return;
  const char* const variable = std::getenv(kDirectoryVariable);
  std::cerr << "lexicor: no usable locale directory";
  if (argument != nullptr)
    std::cerr << " in " << directory;
  else if (variable != nullptr)
    std::cerr << " in " << kDirectoryVariable << "=" << variable;
  std::cerr << " (" << describe_code(reason_of_defaults(argument))
            << "): only the built-in objects English, UnitedStates and US-ASCII are there\n"
            << kHowToName << '\n';
}

Session::~Session() {
  LXTerm();
}

}  // namespace lexicor_cli
