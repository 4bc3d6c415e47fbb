// The standalone platform layer: environment, once-only blocks and trace; locks are seen where threads load
// objects. What happens at the start or the end of a process, or depends on its environment, is seen from outside:
// the program runs in a role (kRoles), and tests/cases/cli/platform.txt says what that writes.
#include <gtest/gtest.h>
#include <sys/auxv.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <map>
#include <mutex>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include "platform/bss1.h"
#include "platform/ras1.h"

namespace {

using std::chrono::milliseconds;

/// Starts eight threads that run `work(index)` at the same moment, and joins them.
template <class Work>
void in_eight_threads(Work work) {
  std::atomic<int> ready{0};
  std::vector<std::thread> threads;
  for (int i = 0; i < 8; ++i) {
    threads.emplace_back([&, i] {
      for (++ready; ready < 8;) std::this_thread::yield();
      work(i);
    });
  }
  for (std::thread& thread : threads) thread.join();
}

/// For roles that are about the end of the process: goes past stdio, whose buffers are flushed at an unknown
/// point.
void say(const char* text) {
  if (write(STDOUT_FILENO, text, strlen(text)) < 0) abort();
}

// ---- Once-only blocks

BSS1_ProcessBlock process_blocks[200];
std::atomic<int> process_inits{0};

// Many blocks whose initialisation is short: everyone waits for it, and for what it stored.
TEST(ProcessBlock, IsInitialisedOnceAndEveryoneWaits) {
  for (BSS1_ProcessBlock& descriptor : process_blocks) {
    descriptor.size_bytes = sizeof(int);
    descriptor.init = [](void* block) {
      int* number = static_cast<int*>(block);
      EXPECT_EQ(*number, 0);  // blocks begin zeroed
      EXPECT_EQ(BSS1_ResolveProcess(&process_blocks[process_inits]), block);
      if (process_inits % 20 == 0) std::this_thread::sleep_for(milliseconds(5));
      *number = ++process_inits;
    };
  }
  in_eight_threads([&](int) {
    for (int i = 0; i < 200; ++i) ASSERT_EQ(*static_cast<int*>(BSS1_ResolveProcess(&process_blocks[i])), i + 1);
  });
  EXPECT_EQ(process_inits, 200);
}

TEST(ProcessBlock, TooLargeIsRefusedAndLeavesNothing) {
  BSS1_ProcessBlock process = BSS1_PROCESS_BLOCK(nullptr, nullptr, SIZE_MAX - 8);
  const BSS1_ThreadBlock thread = BSS1_THREAD_BLOCK(nullptr, nullptr, SIZE_MAX - 8);
  EXPECT_EQ(BSS1_ResolveProcess(&process), nullptr);
  EXPECT_EQ(BSS1_ResolveProcess(&process), nullptr);  // does not wait for the first
  EXPECT_EQ(BSS1_ResolveThread(&thread), nullptr);
}

std::atomic<int> first_inits{0}, first_terms{0}, late_terms{0};
thread_local int second_terms_here = 0;
const BSS1_ThreadBlock late_block = BSS1_THREAD_BLOCK(
    nullptr, [](void*) { ++late_terms; }, 1);
extern const BSS1_ThreadBlock first_block, second_block;

const BSS1_ThreadBlock first_block = BSS1_THREAD_BLOCK(
    [](void* block) {
      EXPECT_EQ(*static_cast<int*>(block), 0);  // blocks begin zeroed
      EXPECT_EQ(BSS1_ResolveThread(&first_block), block);
      *static_cast<int*>(block) = ++first_inits;
    },
    [](void* block) {
      EXPECT_EQ(BSS1_ResolveThread(&first_block), block);   // not a second block
      EXPECT_EQ(second_terms_here, 1);                      // the last one made ends first
      EXPECT_NE(BSS1_ResolveThread(&late_block), nullptr);  // which the thread never had: that one must end too
      ++first_terms;
    },
    sizeof(int));
const BSS1_ThreadBlock second_block = BSS1_THREAD_BLOCK(
    nullptr,
    [](void* block) {
      EXPECT_EQ(BSS1_ResolveThread(&second_block), block);
      EXPECT_NE(BSS1_ResolveThread(&first_block), nullptr);
      ++second_terms_here;
    },
    1);

TEST(ThreadBlock, ExistsOncePerThreadAndEndsWithIt) {
  std::mutex mutex;
  std::set<void*> seen;
  in_eight_threads([&](int) {
    void* block = BSS1_ResolveThread(&first_block);
    EXPECT_NE(BSS1_ResolveThread(&second_block), block);
    EXPECT_EQ(BSS1_ResolveThread(&first_block), block);
    std::unique_lock<std::mutex> held(mutex);
    EXPECT_TRUE(seen.insert(block).second);
    held.unlock();
    while (first_inits < 8) std::this_thread::yield();  // until then no block may be reused for another thread
  });
  EXPECT_EQ(first_terms, 8);
  EXPECT_EQ(late_terms, 8);
}

// ---- The end of the process

BSS1_ProcessBlock inner_block = BSS1_PROCESS_BLOCK(
    nullptr, [](void*) { say("end inner\n"); }, 1);
BSS1_ProcessBlock outer_block = BSS1_PROCESS_BLOCK(
    [](void*) { BSS1_ResolveProcess(&inner_block); },
    [](void*) {
      say(BSS1_ResolveProcess(&inner_block) != nullptr ? "end outer\n" : "end outer, inner is gone\n");
    },
    1);
const BSS1_ThreadBlock speaking_block =
    BSS1_THREAD_BLOCK([](void*) { BSS1_ResolveProcess(&outer_block); }, [](void*) { say("end thread\n"); }, 1);

std::thread* late_thread;
std::atomic<bool> late_thread_may_end{false};

int role_end_order() {
  // Registered before the first block, so it runs after the blocks have ended.
  atexit([] {
    const bool gone =
        BSS1_ResolveProcess(&outer_block) == nullptr && BSS1_ResolveThread(&speaking_block) == nullptr;
    say(gone ? "gone\n" : "still there\n");
    late_thread_may_end = true;
    late_thread->join();
    delete late_thread;
    say("late thread ended\n");
  });
  std::atomic<bool> resolved{false};
  late_thread = new std::thread([&] {
    BSS1_ResolveThread(&speaking_block);
    resolved = true;
    while (!late_thread_may_end) std::this_thread::sleep_for(milliseconds(1));
  });
  while (!resolved) std::this_thread::yield();
  BSS1_ResolveThread(&speaking_block);
  exit(0);
}

void exit_with_3(void*) {
  exit(3);
}
void say_half_made(void*) {
  say("end half-made\n");
}
BSS1_ProcessBlock exiting_process = BSS1_PROCESS_BLOCK(exit_with_3, say_half_made, 1);
const BSS1_ThreadBlock exiting_thread = BSS1_THREAD_BLOCK(exit_with_3, say_half_made, 1);
const BSS1_ThreadBlock exiting_at_end = BSS1_THREAD_BLOCK(nullptr, exit_with_3, 1);

/// In a thread that has another block, which has one of the process.
int beside_others(void (*exits)()) {
  std::thread([&] { BSS1_ResolveThread(&speaking_block), exits(); }).join();
  return 0;
}

std::atomic<bool> slow_thread_ends{false};
const BSS1_ThreadBlock slow_block = BSS1_THREAD_BLOCK([](void*) { BSS1_ResolveProcess(&outer_block); },
                                                      [](void*) {
                                                        slow_thread_ends = true;
                                                        std::this_thread::sleep_for(milliseconds(100));
                                                        say("end slow thread\n");
                                                      },
                                                      1);

/// The main thread ends the process while another thread is in the middle of its termination.
int role_end_waits() {
  std::thread([] { BSS1_ResolveThread(&slow_block); }).detach();
  while (!slow_thread_ends) std::this_thread::yield();
  return 0;
}

// ---- Environment and trace

RAS1_Unit alpha = RAS1_UNIT("alpha");

int role_environment() {
  const char* value = BSS1_GetEnv("LX_PROBE");
  RAS1_Unit units[] = {RAS1_UNIT("alpha"), RAS1_UNIT("beta"), RAS1_UNIT("gamma")};
  uint32_t levels[3];
  for (int i = 0; i < 3; ++i) levels[i] = RAS1_Sync(&units[i]);
  printf("secure=%lu probe=%s levels=%x %x %x\n", getauxval(AT_SECURE), value != nullptr ? value : "(null)",
         levels[0], levels[1], levels[2]);
  return 0;
}

/// Every kind of line, if the unit is traced; errno stays, even when the file cannot be opened.
int role_lines() {
  if (RAS1_Sync(&alpha) == 0) return 0;
  errno = 4711;
  RAS1_Printf(&alpha, 4, "%s", "");
  RAS1_Event(&alpha, 57, RAS1_EVENT_ENTRY, 99);
  RAS1_Event(&alpha, 58, RAS1_EVENT_EXIT_VALUE, 0);
  RAS1_Event(&alpha, 60, RAS1_EVENT_EXIT_VALUE, -1);
  RAS1_Event(&alpha, 61, RAS1_EVENT_EXIT, 99);
  RAS1_Printf(&alpha, 1, "Lexicor init count = %d", 3);
  RAS1_Printf(&alpha, 2, "Ends with a newline %s\n", "of its own");
  RAS1_Printf(&alpha, 3, "Path: %s\n file:\t%s\x7F", "a\\b", "\xC3\xA4");
  RAS1_Dump(&alpha, 70, "0123456789ABCDEF\x7F\x80~ \n", 21, "String1");
  RAS1_Dump(&alpha, 71, "x", 1, "Two\nlines");
  RAS1_Dump(&alpha, 72, "x", 0, "Empty");
  RAS1_Dump(&alpha, 73, nullptr, 5, "None");
  return errno == 4711 ? 0 : 1;
}

int role_message() {
  if (RAS1_Sync(&alpha) == 0) return 0;
  std::thread([&] { RAS1_Printf(&alpha, 1, "one"); }).join();
  RAS1_Printf(&alpha, 2, "two");
  return 0;
}

int role_long_messages() {
  RAS1_Sync(&alpha);
  for (size_t bytes = 1900; bytes < 2100; ++bytes)
    RAS1_Printf(&alpha, 1, "%s\n", std::string(bytes, 'x').c_str());
  RAS1_Printf(&alpha, 1, "%s", std::string(2000, '\n').c_str());  // grows when it is spelled out
  return 0;
}

int role_writers() {
  RAS1_Sync(&alpha);
  in_eight_threads([&](int i) {
    const std::string text(static_cast<size_t>(100 + 50 * i), static_cast<char>('a' + i));
    for (int k = 0; k < 100; ++k) RAS1_Printf(&alpha, i, "%s", text.c_str());
  });
  return 0;
}

TEST(Trace, LevelsChangeWhenItIsConfigured) {
  RAS1_Unit unit = RAS1_UNIT("lxinit");
  RAS1_Configure("lxinit=d8", nullptr);
  EXPECT_EQ(RAS1_Sync(&unit), 0xD8u);
  EXPECT_EQ(unit.level, 0xD8u);
  EXPECT_EQ(unit.seen, RAS1_ChangeCounter);
  RAS1_Configure(nullptr, nullptr);
  EXPECT_NE(unit.seen, RAS1_ChangeCounter);
  EXPECT_EQ(RAS1_Sync(&unit), 0u);
}

const std::map<std::string, int (*)()> kRoles = {
    {"environment", role_environment},
    {"end_order", role_end_order},
    {"end_waits", role_end_waits},
    {"exit_in_process_init", [] { return beside_others([] { BSS1_ResolveProcess(&exiting_process); }); }},
    {"exit_in_thread_init", [] { return beside_others([] { BSS1_ResolveThread(&exiting_thread); }); }},
    {"exit_in_thread_term", [] { return beside_others([] { BSS1_ResolveThread(&exiting_at_end); }); }},
    {"lines", role_lines},
    {"message", role_message},
    {"long_messages", role_long_messages},
    {"writers", role_writers},
};

}  // namespace

int main(int argc, char** argv) {
  if (argc == 3 && strcmp(argv[1], "--role") == 0) {
    alarm(60);  // a role that hangs fails
    return kRoles.at(argv[2])();
  }
  testing::InitGoogleTest(&argc, argv);
  return RUN_ALL_TESTS();
}
