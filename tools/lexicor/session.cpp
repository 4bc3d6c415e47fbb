// The order in which the locale directory is looked for: the option, the environment variable, the places
// beside the program, the library's own default.
#include "session.h"

#include <lx.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <vector>

#include "notices.h"

namespace lexicor_cli {

namespace {

namespace fs = std::filesystem;

constexpr char kDirectoryVariable[] = "LX_LOCALEDIR";
constexpr char kHowToName[] =
    "name a locale directory with --locale-dir DIR or the environment variable LX_LOCALEDIR";

// Of the session; empty: the library has found it.
std::string g_directory;

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
  if (secure_getenv(kDirectoryVariable) != nullptr) return {};
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

/// The directory that the library looks in when none is given to it.
std::string found_directory() {
  char place[4096];
  for (const int32_t selector : {0, 1}) {
    if (LXGetDataLocation(place, sizeof place, selector) > 0) return place;
  }
  return {};
}

/// Why no control file could be used: LXInit says only that it was so.
std::string reason_of_defaults(const char* directory) {
  std::error_code error;
  const std::string file = control_file_of(directory != nullptr ? directory : found_directory());
  if (fs::is_regular_file(file, error) && fs::is_empty(file, error)) return file + " is empty";
  int32_t code = LX_OK;
  LXObjManager* manager = LXInitObjManager(directory, 0, &code);
  if (manager != nullptr) LXTermObjManager(manager);
  return code != LX_OK ? describe_code(code) : "it could not be read a moment before";
}

}  // namespace

std::string locale_directory() {
  return g_directory.empty() ? found_directory() : g_directory;
}

std::string describe_code(int code) {
  return LXGetErrorText(code);
}

std::string load_problem(int type, const std::string& title, const std::string& name, int code) {
  int32_t found = LX_OK;
  const LXObject* const object =
      LXGetObjFromName(nullptr, type, name.c_str(), static_cast<int32_t>(name.size()), LX_FIND_ONLY, &found);
  std::string text =
      title + " " + name + " cannot be loaded: " + describe_code(code) + " (code " + std::to_string(code) + ")";
  if (object == nullptr) return text;
  const std::string directory = locale_directory();
  std::vector<char> file(directory.size() + 32);
  const uint16_t id = reinterpret_cast<const LXObjDisk*>(object)->id;
  LXGetDataFileName(directory.c_str(), type, id, file.data(), static_cast<int32_t>(file.size()));
  return text + ": " + file.data();
}

Session::Session(const CommonOptions& common) {
  const std::string directory = choose_directory(common.locale_dir);
  g_directory = directory;
  const char* const argument = directory.empty() ? nullptr : directory.c_str();
  const int32_t code = LXInit(argument, nullptr, nullptr, nullptr, 0);
  if (code != LX_OK && code != LX_W_DEFAULTS)
    throw Failure(kDataError, "the library cannot start: " + describe_code(code));
  built_in_only_ = code == LX_W_DEFAULTS;
  if (!built_in_only_) return;
  const char* const variable = secure_getenv(kDirectoryVariable);
  notices() << g_program << ": no usable locale directory";
  if (argument != nullptr)
    notices() << " in " << directory;
  else if (variable != nullptr)
    notices() << " in " << kDirectoryVariable << "=" << variable;
  notices() << " (" << reason_of_defaults(argument)
            << "): only the built-in objects English, UnitedStates and US-ASCII are there\n"
            << g_program << ": " << kHowToName << '\n';
}

Session::~Session() {
  LXTerm();
}

}  // namespace lexicor_cli
