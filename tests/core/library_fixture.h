// What most tests of the core start from: a scratch locale directory, hooks that know every block, an
// environment without the library's variables, and a check at the end that nothing is left behind.
#pragma once

#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdlib>
#include <functional>
#include <string>
#include <vector>

#include "core/lxformat.h"
#include "core/lxobjtypes.h"
#include "core/lxrecords.h"
#include "lx.h"
#include "platform/ras1.h"
#include "platform/recording_ras1.h"
#include "support/hooks.h"
#include "support/object_files.h"

// Which write what was reached, where that is measured.
extern "C" void __gcov_dump(void) __attribute__((weak));
extern "C" int __llvm_profile_write_file(void) __attribute__((weak));

namespace lx::test {

/// Runs `action` with its assertions in a process of its own, which `end` ends, so that a crash, or the end that a
/// sanitizer makes, is one failure.
inline void expect_in_child(const std::string& what, void (*end)(int), const std::function<void()>& action) {
  SCOPED_TRACE(what);
  const auto run = [&] {
    action();
    if (end == _exit && __gcov_dump != nullptr) __gcov_dump();
    if (end == _exit && __llvm_profile_write_file != nullptr) __llvm_profile_write_file();
    end(::testing::Test::HasFailure() ? 3 : 0);
  };
  EXPECT_EXIT(run(), ::testing::ExitedWithCode(0), "");
}

class LibraryTest : public ::testing::Test {
 protected:
  void SetUp() override { clear_environment(); }

  void TearDown() override {
    terminate();
    EXPECT_EQ(hooks.live_blocks(), 0u);
    EXPECT_EQ(hooks.wrong_frees(), 0u);
    clear_environment();
    RecordingTrace::set_level(0);
    RecordingTrace::take();
  }

  int32_t init(const char* path, uint32_t options = 0) {
    return LXInit(path, Hooks::allocate, Hooks::release, &hooks, options);
  }
  int32_t init() { return init(directory.path().c_str()); }

  static void terminate() {
    while (LXTerm() != LX_E_NOT_INITIALIZED) {
    }
  }

  /// The texts of the messages that `action` causes while the level is `level`.
  static std::vector<std::string> messages(uint32_t level, const std::function<void()>& action) {
    RecordingTrace::take();
    RecordingTrace::set_level(level);
    action();
    RecordingTrace::set_level(0);
    std::vector<std::string> texts;
    for (const TraceRecord& record : RecordingTrace::take())
      if (record.kind == TraceRecord::kMessage) texts.push_back(record.text);
    return texts;
  }

  /// The paths that `action` opens, in order.
  static std::vector<std::string> opened(const std::function<void()>& action) {
    const std::string prefix = "Opening file ";
    std::vector<std::string> paths;
    for (const std::string& text : messages(RAS1_LEVEL_INPUT, action))
      if (text.rfind(prefix, 0) == 0) paths.push_back(text.substr(prefix.size()));
    return paths;
  }

  Hooks hooks;
  ScratchDirectory directory;

 private:
  static void clear_environment() {
    unsetenv("LX_LOCALEDIR");
    unsetenv("LX_LANG");
  }
};

/// The built-in language with other defaults.
inline ByteString language(uint16_t territory, uint16_t codepage, uint16_t sort) {
  namespace words = format::language;
  ByteString payload = payload_of(kBuiltInLanguage);
  put_le16(payload.data() + 2 * words::kDefaultTerritory, territory);
  put_le16(payload.data() + 2 * words::kDefaultCodepage, codepage);
  put_le16(payload.data() + 2 * words::kDefaultSort, sort);
  return payload;
}

inline constexpr char kDefaultControl[] = "/Tessarin/locale/control.nls";

}  // namespace lx::test
