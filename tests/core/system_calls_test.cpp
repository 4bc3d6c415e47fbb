// Calls of the operating system that fail, one after another, and reads that are short or interrupted: the code says
// so or the result is the same, no block and no descriptor is lost, and a file is the old one or the new one.
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdarg>
#include <cstring>
#include <set>

#include "core/tiny_directory.h"
#include "support/catalog_builder.h"
#include "support/forms.h"
#include "support/slowness.h"

namespace lx::test {
namespace {

/// How calls fail: the one with this number, or from it on.
struct Faults {
  int at = 0;     // 0: none
  int error = 0;  // 0: reads give one byte
  bool from_then_on = false;
  bool reads_only = false;

  int calls = 0;
  bool counting = false;

  /// Whether this call fails; errno is set.
  bool hit(bool reads) {
    if (!counting || (reads_only && !reads)) return false;
    ++calls;
    if (at == 0 || (from_then_on ? calls < at : calls != at)) return false;
    errno = error;
    return true;
  }
};
Faults faults;

}  // namespace
}  // namespace lx::test

// What the linker puts in place of the calls (--wrap).
extern "C" {

using lx::test::faults;

#define LX_TEST_CALL(NAME, PARAMETERS, ARGUMENTS)            \
  int __real_##NAME PARAMETERS;                              \
  int __wrap_##NAME PARAMETERS;                              \
  int __wrap_##NAME PARAMETERS {                             \
    return faults.hit(false) ? -1 : __real_##NAME ARGUMENTS; \
  }
LX_TEST_CALL(access, (const char* path, int mode), (path, mode))
LX_TEST_CALL(creat64, (const char* path, mode_t mode), (path, mode))
LX_TEST_CALL(fstat64, (int descriptor, struct stat64* status), (descriptor, status))
LX_TEST_CALL(rename, (const char* from, const char* to), (from, to))
LX_TEST_CALL(stat64, (const char* path, struct stat64* status), (path, status))
LX_TEST_CALL(unlink, (const char* path), (path))

int __real_open64(const char* path, int flags, ...);
int __wrap_open64(const char* path, int flags, ...);
int __wrap_open64(const char* path, int flags, ...) {
  va_list arguments;
  va_start(arguments, flags);
  const mode_t mode = (flags & O_CREAT) != 0 ? va_arg(arguments, mode_t) : 0;
  va_end(arguments);
  return faults.hit(false) ? -1 : __real_open64(path, flags, mode);
}
// A descriptor is gone when closing it fails.
int __real_close(int descriptor);
int __wrap_close(int descriptor);
int __wrap_close(int descriptor) {
  const int closed = __real_close(descriptor);
  return faults.hit(false) ? -1 : closed;
}
off64_t __real_lseek64(int descriptor, off64_t offset, int whence);
off64_t __wrap_lseek64(int descriptor, off64_t offset, int whence);
off64_t __wrap_lseek64(int descriptor, off64_t offset, int whence) {
  return faults.hit(false) ? -1 : __real_lseek64(descriptor, offset, whence);
}
ssize_t __real_read(int descriptor, void* buffer, size_t bytes);
ssize_t __wrap_read(int descriptor, void* buffer, size_t bytes);
ssize_t __wrap_read(int descriptor, void* buffer, size_t bytes) {
  if (!faults.hit(true)) return __real_read(descriptor, buffer, bytes);
  return faults.error != 0 ? -1 : __real_read(descriptor, buffer, bytes != 0 ? 1 : 0);
}

}  // extern "C"

namespace lx::test {
namespace {

int next_descriptor() {
  const int descriptor = dup(STDERR_FILENO);
  close(descriptor);
  return descriptor;
}

/// What a run gave: every code, and what a caller reads.
struct Outcome {
  std::set<int32_t> codes;
  std::string text;

  bool failed() const { return codes.size() > 1 || *codes.begin() != LX_OK; }
};

class SystemCallsTest : public LibraryTest {
 protected:
  /// Calls `run` with each call failing in each way, between the two looks at what is left.
  template <class Run, class Check>
  void at_every_call(const Run& run, const Check& check) {
    constexpr Faults kWays[] = {{1, EIO, false},         {1, EIO, true},      {1, ENOSPC, false},
                                {1, EINTR, false, true}, {1, 0, false, true}, {1, 0, true, true}};
    const Outcome sound = counted({}, run);
    ASSERT_FALSE(sound.failed());
    for (Faults way : kWays)
      for (bool reached = true; reached; way.at += kSlowness) {
        SCOPED_TRACE("call " + std::to_string(way.at) + ", error " + std::to_string(way.error) +
                     (way.from_then_on ? " from then on" : ""));
        const int descriptor = next_descriptor();
        const Outcome outcome = counted(way, run);
        reached = faults.calls >= way.at;
        EXPECT_EQ(next_descriptor(), descriptor) << "a descriptor is lost";
        EXPECT_EQ(hooks.live_blocks(), 0u);
        // What is interrupted or short is done again.
        if (way.reads_only || !outcome.failed()) {
          EXPECT_EQ(outcome.text, sound.text);
        }
        EXPECT_FALSE(way.reads_only && outcome.failed());
        check(outcome);
        if (HasFailure()) return;
      }
  }

 private:
  template <class Run>
  static Outcome counted(const Faults& way, const Run& run) {
    faults = way;
    faults.counting = true;
    Outcome outcome = run();
    faults.counting = false;
    return outcome;
  }
};

TEST_F(SystemCallsTest, LocalesAndCatalogs) {
  write_tiny_directory(directory);
  directory.write("catalog", catalog_file({{1, {{1, "one"}}}, {3, {{4, "four"}}}}, "English.TINY-SJIS"));
  constexpr std::pair<int32_t, const char*> kParts[] = {
      {LX_LANGUAGE, "English"}, {LX_TERRITORY, "Elsewhere"}, {LX_CODEPAGE, "TINY-SHIFT"}, {LX_SORT, "Default"}};
  const std::string catalog_name = directory.file("catalog");
  const auto run = [&] {
    Outcome outcome;
    const auto note = [&](int32_t code) { outcome.codes.insert(code); };
    note(init());
    int32_t rc = -1;
    // A program that loads the objects of a locale itself sees where built-in data have taken the place of a file.
    for (const auto& [type, name] : kParts) {
      LXGetObjFromName(nullptr, type, name, static_cast<int32_t>(strlen(name)), LX_FIND_AND_LOAD, &rc);
      note(rc);
    }
    LXLocale* const locale = LXGetLocale("English_Elsewhere.TINY-SHIFT@Default", 0, &rc);
    note(rc);
    EXPECT_EQ(locale != nullptr, rc == LX_OK);
    if (locale != nullptr) outcome.text = state_of(locale);
    for (const uint32_t mode : {0u, uint32_t{LX_CATALOG_LOAD}}) {
      LXCatalog* const catalog =
          locale != nullptr ? LXOpenCatalog(locale, nullptr, catalog_name.c_str(), mode) : nullptr;
      if (locale != nullptr) note(LXGetError(locale));
      char message[20] = "";
      if (catalog != nullptr) note(LXGetMessage(catalog, 3, 4, message, sizeof(message), nullptr));
      outcome.text += message;
      if (catalog != nullptr) note(LXCloseCatalog(catalog));
    }
    EXPECT_EQ(LXReleaseLocale(locale), LX_OK);
    note(LXTerm());
    return outcome;
  };
  at_every_call(run, [](const Outcome& outcome) {
    static const std::set<int32_t> documented = {
        LX_OK,        LX_E_NOT_INITIALIZED, LX_E_OPEN,      LX_W_DEFAULTS, LX_E_NO_CODEPAGE, LX_E_NO_LANGUAGE,
        LX_E_NO_SORT, LX_E_NO_TERRITORY,    LX_E_NOT_FOUND, LX_E_CATALOG,  LX_E_FILE_IO};
    for (const int32_t code : outcome.codes) EXPECT_EQ(documented.count(code), 1u) << code;
  });
}

TEST_F(SystemCallsTest, AFileIsReplacedAsAWhole) {
  const auto run = [&] {
    directory.write_text("file.txt", "old");
    Outcome outcome;
    outcome.codes.insert(init());
    int32_t rc = -1;
    LXFile* file = LXOpenFile(1, directory.file("file.txt").c_str(), LX_WRITE, 0, &rc);
    outcome.codes.insert(rc);
    if (file != nullptr && ::write(file->descriptor, "new!", 4) != 4) outcome.codes.insert(LX_E_FILE_IO);
    if (file != nullptr && LXCloseFile(file, 0) != 0) outcome.codes.insert(LX_E_FILE_IO);
    file = LXOpenFile(1, directory.file("file.txt").c_str(), LX_READ_WRITE, 0, &rc);
    outcome.codes.insert(rc);
    char text[8] = "";
    int32_t read_code = LX_OK;
    if (file != nullptr) LXReadFile(file, text, 4, &read_code);
    outcome.codes.insert(read_code);
    if (file != nullptr) LXCloseFile(file, 0);
    outcome.codes.insert(LXTerm());
    return outcome;
  };
  directory.write("control.nls", control_file({{1, LX_LANGUAGE, "English"}}));
  at_every_call(run, [&](const Outcome&) {
    const ByteString content = directory.read("file.txt");
    const std::string text(content.begin(), content.end());
    EXPECT_TRUE(text == "old" || text == "new!") << text;
  });
}

}  // namespace
}  // namespace lx::test
