// The standalone platform layer: locks, environment, once-only blocks and trace. What happens at the start or
// the end of a process is observed in another process: the test program runs itself again in a role (see kRoles
// at the end). One file, although it is long, because the roles need one main function.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <pthread.h>
#include <spawn.h>
#include <sys/auxv.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <cctype>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <string>
#include <thread>
#include <vector>

#include "platform/bss1.h"
#include "platform/ras1.h"

namespace {

namespace fs = std::filesystem;
using std::chrono::milliseconds;

// ---- Helpers

class TemporaryDirectory {
 public:
  TemporaryDirectory() {
    std::string pattern = (fs::temp_directory_path() / "lxplatform.XXXXXX").string();
    path_ = mkdtemp(pattern.data());
  }
  ~TemporaryDirectory() { fs::remove_all(path_); }
  std::string operator/(const char* name) const { return (path_ / name).string(); }

 private:
  fs::path path_;
};

std::string contents(const std::string& path) {
  std::ifstream in(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(in), {}};
}

std::vector<std::string> lines_of(const std::string& text) {
  std::vector<std::string> lines;
  size_t at = 0;
  for (size_t end; (end = text.find('\n', at)) != std::string::npos; at = end + 1)
    lines.push_back(text.substr(at, end - at));
  if (at < text.size()) lines.push_back(text.substr(at) + "<no newline>");
  return lines;
}

/// Starts eight threads that run `work(index)` at the same moment, and joins them.
template <class Work>
void in_eight_threads(Work work) {
  pthread_barrier_t barrier;
  pthread_barrier_init(&barrier, nullptr, 8);
  std::vector<std::thread> threads;
  for (int i = 0; i < 8; ++i) {
    threads.emplace_back([&, i] {
      pthread_barrier_wait(&barrier);
      work(i);
    });
  }
  for (std::thread& thread : threads) thread.join();
  pthread_barrier_destroy(&barrier);
}

struct Outcome {
  int exit_code;  // -1: ended by a signal
  std::string out;
  std::string err;
};

pid_t start_role(const char* program, const char* role, const std::vector<std::string>& variables,
                 const std::string& out, const std::string& err) {
  std::vector<std::string> words = variables;
  for (const char* kept :
       {"PATH", "LD_LIBRARY_PATH", "ASAN_OPTIONS", "LSAN_OPTIONS", "TSAN_OPTIONS", "UBSAN_OPTIONS"})
    if (const char* value = getenv(kept)) words.push_back(std::string(kept) + "=" + value);
  std::vector<char*> environment;
  for (std::string& word : words) environment.push_back(word.data());
  environment.push_back(nullptr);
  const char* const arguments[] = {program, "--role", role, nullptr};

  posix_spawn_file_actions_t files;
  posix_spawn_file_actions_init(&files);
  posix_spawn_file_actions_addopen(&files, 1, out.c_str(), O_WRONLY | O_CREAT | O_APPEND, 0600);
  posix_spawn_file_actions_addopen(&files, 2, err.c_str(), O_WRONLY | O_CREAT | O_APPEND, 0600);
  pid_t child = -1;
  posix_spawn(&child, program, &files, nullptr, const_cast<char**>(arguments), environment.data());
  posix_spawn_file_actions_destroy(&files);
  return child;
}

int exit_code_of(pid_t child) {
  int status = 0;
  if (waitpid(child, &status, 0) != child) return -1;
  return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

Outcome run_role(const char* role, const std::vector<std::string>& variables = {},
                 const char* program = "/proc/self/exe") {
  TemporaryDirectory directory;
  const std::string out = directory / "out", err = directory / "err";
  const int code = exit_code_of(start_role(program, role, variables, out, err));
  return {code, contents(out), contents(err)};
}

/// For roles that are about the end of the process: goes past stdio, whose buffers are flushed at an unknown
/// point.
void say(const char* text) {
  if (write(STDOUT_FILENO, text, strlen(text)) < 0) abort();
}

// ---- Locks and environment

TEST(Lock, ExcludesOtherThreads) {
  BSS1_Lock lock, other;
  ASSERT_EQ(BSS1_InitializeLock(&lock), 0);
  ASSERT_EQ(BSS1_InitializeLock(&other), 0);
  ASSERT_EQ(BSS1_GetLock(&other), 0);  // the locks are independent
  volatile int count = 0;
  in_eight_threads([&](int) {
    for (int i = 0; i < 500; ++i) {
      ASSERT_EQ(BSS1_GetLock(&lock), 0);
      const int before = count;
      std::this_thread::yield();
      count = before + 1;
      ASSERT_EQ(BSS1_ReleaseLock(&lock), 0);
    }
  });
  EXPECT_EQ(count, 8 * 500);
  EXPECT_EQ(BSS1_ReleaseLock(&other), 0);
  EXPECT_EQ(BSS1_DestroyLock(&other), 0);
  EXPECT_EQ(BSS1_DestroyLock(&lock), 0);
  EXPECT_EQ(BSS1_InitializeLock(&lock), 0);  // may be used again
  EXPECT_EQ(BSS1_GetLock(&lock), 0);
  EXPECT_EQ(BSS1_ReleaseLock(&lock), 0);
  EXPECT_EQ(BSS1_DestroyLock(&lock), 0);
}

TEST(Environment, GivesValues) {
  setenv("LX_PROBE", "some value", 1);
  EXPECT_STREQ(BSS1_GetEnv("LX_PROBE"), "some value");
  setenv("LX_PROBE", "", 1);
  EXPECT_STREQ(BSS1_GetEnv("LX_PROBE"), "");
  unsetenv("LX_PROBE");
  EXPECT_EQ(BSS1_GetEnv("LX_PROBE"), nullptr);
}

int role_environment() {
  const char* value = BSS1_GetEnv("LX_PROBE");
  RAS1_Unit unit = RAS1_UNIT("alpha");
  printf("secure=%lu probe=%s level=%x\n", getauxval(AT_SECURE), value != nullptr ? value : "(null)",
         RAS1_Sync(&unit));
  return 0;
}

TEST(Environment, IsIgnoredByPrivilegedPrograms) {
  const std::vector<std::string> variables = {"LX_PROBE=x", "LX_TRACE=*=ff"};
  EXPECT_EQ(run_role("environment", variables).out, "secure=0 probe=x level=ff\n");

  if (geteuid() != 0) GTEST_SKIP() << "only root can give a program to another user";
  TemporaryDirectory directory;
  const std::string program = directory / "program";
  fs::copy_file("/proc/self/exe", program);
  ASSERT_EQ(chown(program.c_str(), 65534, 65534), 0);
  ASSERT_EQ(chmod(program.c_str(), 04755), 0);
  const Outcome outcome = run_role("environment", variables, program.c_str());
  if (outcome.out.find("secure=1") == std::string::npos)
    GTEST_SKIP() << "set-user-id programs do not work here: " << outcome.out << outcome.err;
  EXPECT_EQ(outcome.out, "secure=1 probe=(null) level=0\n");
}

// ---- Once-only blocks

struct Probe {
  int number;
  BSS1_ProcessBlock* own_descriptor;
};

std::atomic<int> process_inits{0};
extern BSS1_ProcessBlock slow_block;

void init_slowly(void* block) {
  Probe* probe = static_cast<Probe*>(block);
  EXPECT_EQ(probe->number, 0);  // blocks begin zeroed
  EXPECT_EQ(BSS1_ResolveProcess(&slow_block), block);
  ++process_inits;
  std::this_thread::sleep_for(milliseconds(50));
  probe->number = 7;
}

BSS1_ProcessBlock slow_block = BSS1_PROCESS_BLOCK(init_slowly, nullptr, sizeof(Probe));

TEST(ProcessBlock, IsInitialisedOnceAndEveryoneWaits) {
  void* seen[8] = {};
  int numbers[8] = {};
  in_eight_threads([&](int i) {
    seen[i] = BSS1_ResolveProcess(&slow_block);
    numbers[i] = static_cast<Probe*>(seen[i])->number;
  });
  EXPECT_EQ(process_inits, 1);
  for (int i = 0; i < 8; ++i) {
    EXPECT_EQ(seen[i], seen[0]);
    EXPECT_EQ(numbers[i], 7);
  }
}

// Many blocks whose initialisation is short: the moment in which a finished block is published.
TEST(ProcessBlock, IsPublishedWhole) {
  constexpr int kBlocks = 200;
  static BSS1_ProcessBlock descriptors[kBlocks];
  static std::atomic<int> inits{0};
  for (BSS1_ProcessBlock& descriptor : descriptors) {
    descriptor.init = [](void* block) { static_cast<Probe*>(block)->number = ++inits; };
    descriptor.size_bytes = sizeof(Probe);
  }
  in_eight_threads([&](int) {
    for (BSS1_ProcessBlock& descriptor : descriptors)
      ASSERT_GT(static_cast<Probe*>(BSS1_ResolveProcess(&descriptor))->number, 0);
  });
  EXPECT_EQ(inits, kBlocks);
}

TEST(ProcessBlock, TooLargeIsRefusedAndLeavesNothing) {
  BSS1_ProcessBlock process = BSS1_PROCESS_BLOCK(nullptr, nullptr, SIZE_MAX - 8);
  const BSS1_ThreadBlock thread = BSS1_THREAD_BLOCK(nullptr, nullptr, SIZE_MAX - 8);
  EXPECT_EQ(BSS1_ResolveProcess(&process), nullptr);
  EXPECT_EQ(BSS1_ResolveProcess(&process), nullptr);  // does not wait for the first
  EXPECT_EQ(BSS1_ResolveThread(&thread), nullptr);
}

struct ThreadProbe {
  pthread_t owner;
  void* process_block;
};

std::atomic<int> first_inits{0}, first_terms{0};
thread_local int second_terms_here = 0;
BSS1_ProcessBlock base_block = BSS1_PROCESS_BLOCK(nullptr, nullptr, sizeof(Probe));
extern const BSS1_ThreadBlock first_block;
extern const BSS1_ThreadBlock second_block;

void init_first(void* block) {
  ThreadProbe* probe = static_cast<ThreadProbe*>(block);
  EXPECT_EQ(probe->process_block, nullptr);  // blocks begin zeroed
  EXPECT_EQ(BSS1_ResolveThread(&first_block), block);
  probe->owner = pthread_self();
  probe->process_block = BSS1_ResolveProcess(&base_block);
  ++first_inits;
}

void term_first(void* block) {
  EXPECT_TRUE(pthread_equal(static_cast<ThreadProbe*>(block)->owner, pthread_self()));
  EXPECT_EQ(BSS1_ResolveThread(&first_block), block);  // not a second block
  EXPECT_EQ(BSS1_ResolveProcess(&base_block), static_cast<ThreadProbe*>(block)->process_block);
  EXPECT_EQ(second_terms_here, 1);  // the last one made ends first
  ++first_terms;
}

void term_second(void* block) {
  EXPECT_EQ(BSS1_ResolveThread(&second_block), block);
  EXPECT_NE(BSS1_ResolveThread(&first_block), nullptr);
  ++second_terms_here;
}

const BSS1_ThreadBlock first_block = BSS1_THREAD_BLOCK(init_first, term_first, sizeof(ThreadProbe));
const BSS1_ThreadBlock second_block = BSS1_THREAD_BLOCK(nullptr, term_second, sizeof(ThreadProbe));

TEST(ThreadBlock, ExistsOncePerThreadAndEndsWithIt) {
  first_inits = first_terms = 0;
  void* seen[8] = {};
  pthread_barrier_t all_resolved;  // until then no block may be reused for another thread
  pthread_barrier_init(&all_resolved, nullptr, 8);
  in_eight_threads([&](int i) {
    seen[i] = BSS1_ResolveThread(&first_block);
    EXPECT_NE(BSS1_ResolveThread(&second_block), seen[i]);
    EXPECT_EQ(BSS1_ResolveThread(&first_block), seen[i]);
    pthread_barrier_wait(&all_resolved);
    EXPECT_EQ(first_terms, 0);
    pthread_barrier_wait(&all_resolved);
  });
  pthread_barrier_destroy(&all_resolved);
  EXPECT_EQ(first_inits, 8);
  EXPECT_EQ(first_terms, 8);
  for (int i = 0; i < 8; ++i) {
    for (int j = 0; j < i; ++j) EXPECT_NE(seen[i], seen[j]);
  }
}

// A termination that resolves a block which the thread never had: that one must end too.
TEST(ThreadBlock, MadeDuringTerminationEndsToo) {
  static std::atomic<int> late_terms;
  late_terms = 0;
  static const BSS1_ThreadBlock late = BSS1_THREAD_BLOCK(
      nullptr, [](void*) { ++late_terms; }, 1);
  static const BSS1_ThreadBlock early = BSS1_THREAD_BLOCK(
      nullptr, [](void*) { EXPECT_NE(BSS1_ResolveThread(&late), nullptr); }, 1);
  std::thread([] { BSS1_ResolveThread(&early); }).join();
  EXPECT_EQ(late_terms, 1);
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

/// The main thread ends the process while another thread is in the middle of its termination.
int role_end_waits() {
  static std::atomic<bool> ending{false};
  static const BSS1_ThreadBlock slow = BSS1_THREAD_BLOCK([](void*) { BSS1_ResolveProcess(&outer_block); },
                                                         [](void*) {
                                                           ending = true;
                                                           std::this_thread::sleep_for(milliseconds(100));
                                                           say("end slow thread\n");
                                                         },
                                                         1);
  std::thread([] { BSS1_ResolveThread(&slow); }).detach();
  while (!ending) std::this_thread::yield();
  return 0;
}

int role_exit_in_process_init() {
  static BSS1_ProcessBlock block =
      BSS1_PROCESS_BLOCK([](void*) { exit(3); }, [](void*) { say("end half-made\n"); }, 1);
  BSS1_ResolveThread(&speaking_block);
  BSS1_ResolveProcess(&block);
  return 0;
}

int role_exit_in_thread_init() {
  static const BSS1_ThreadBlock block =
      BSS1_THREAD_BLOCK([](void*) { exit(3); }, [](void*) { say("end half-made\n"); }, 1);
  BSS1_ResolveThread(&speaking_block);
  BSS1_ResolveThread(&block);
  return 0;
}

int role_exit_in_thread_term() {
  static const BSS1_ThreadBlock block = BSS1_THREAD_BLOCK(
      nullptr, [](void*) { exit(3); }, 1);
  std::thread([] {
    BSS1_ResolveThread(&speaking_block);
    BSS1_ResolveThread(&block);
  }).join();
  return 0;
}

TEST(ProcessEnd, OrderOfTerminations) {
  const struct {
    const char* role;
    int exit_code;
    const char* out;
  } kCases[] = {
      {"end_order", 0, "end thread\nend outer\nend inner\ngone\nlate thread ended\n"},
      {"end_waits", 0, "end slow thread\nend outer\nend inner\n"},
      {"exit_in_process_init", 3, "end thread\nend outer\nend inner\n"},
      {"exit_in_thread_init", 3, "end thread\nend outer\nend inner\n"},
      {"exit_in_thread_term", 3, "end thread\nend outer\nend inner\n"},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.role);
    const Outcome outcome = run_role(c.role);
    EXPECT_EQ(outcome.exit_code, c.exit_code);
    EXPECT_EQ(outcome.out, c.out);
    EXPECT_EQ(outcome.err, "");  // where a leak checker would complain
  }
}

// ---- Trace

/// A line without its time and thread, or the whole line when it does not begin with them.
std::string without_head(const std::string& line) {
  const char kTime[] = "0000-00-00T00:00:00.000000Z ";  // 0 stands for any digit
  size_t at = 0;
  for (; kTime[at] != '\0'; ++at)
    if (at >= line.size() || (isdigit(line[at]) ? '0' : line[at]) != kTime[at]) return line;
  const size_t end = line.find_first_not_of("0123456789", at);
  return end != at && end < line.size() && line[end] == ' ' ? line.substr(end + 1) : line;
}

std::vector<std::string> trace_texts(const std::string& trace) {
  std::vector<std::string> texts;
  for (const std::string& line : lines_of(trace)) texts.push_back(without_head(line));
  return texts;
}

TEST(Trace, FormatOfLines) {
  TemporaryDirectory directory;
  const std::string path = directory / "trace";
  RAS1_Unit unit = RAS1_UNIT("lxinit");
  EXPECT_NE(unit.seen, RAS1_ChangeCounter);
  RAS1_Configure("lxinit=d8", path.c_str());
  EXPECT_EQ(RAS1_Sync(&unit), 0xD8u);
  EXPECT_EQ(unit.level, 0xD8u);
  EXPECT_EQ(unit.seen, RAS1_ChangeCounter);
  EXPECT_FALSE(fs::exists(path));  // there was nothing to write yet

  errno = 4711;
  RAS1_Event(&unit, 57, RAS1_EVENT_ENTRY, 99);
  RAS1_Event(&unit, 58, RAS1_EVENT_EXIT_VALUE, 0);
  RAS1_Event(&unit, 59, RAS1_EVENT_EXIT_VALUE, 0x1F40);
  RAS1_Event(&unit, 60, RAS1_EVENT_EXIT_VALUE, -1);
  RAS1_Event(&unit, 61, RAS1_EVENT_EXIT, 99);
  RAS1_Printf(&unit, 1, "Lexicor init count = %d", 3);
  RAS1_Printf(&unit, 2, "Ends with a newline %s\n", "of its own");
  RAS1_Printf(&unit, 3, "Path: %s\n file:\t%s\x7F", "a\\b", "\xC3\xA4");
  RAS1_Printf(&unit, 4, "%s", "");
  RAS1_Dump(&unit, 70, "0123456789ABCDEF\x7F\x80~ \n", 21, "String1");
  RAS1_Dump(&unit, 71, "x", 1, "Two\nlines");
  RAS1_Dump(&unit, 72, "x", 0, "Empty");
  RAS1_Dump(&unit, 73, nullptr, 5, "None");
  EXPECT_EQ(errno, 4711);
  RAS1_Configure(nullptr, nullptr);
  EXPECT_NE(unit.seen, RAS1_ChangeCounter);
  EXPECT_EQ(RAS1_Sync(&unit), 0u);

  const std::vector<std::string> expected = {
      "lxinit:57 entry",
      "lxinit:58 exit 0x0",
      "lxinit:59 exit 0x1f40",
      sizeof(intptr_t) == 8 ? "lxinit:60 exit 0xffffffffffffffff" : "lxinit:60 exit 0xffffffff",
      "lxinit:61 exit",
      "lxinit:1 Lexicor init count = 3",
      "lxinit:2 Ends with a newline of its own",
      "lxinit:3 Path: a\\b\\n file:\\x09\xC3\xA4\\x7f",
      "lxinit:4 ",
      "lxinit:70 String1: 21 bytes",
      "lxinit:70 0000  30 31 32 33 34 35 36 37 38 39 41 42 43 44 45 46  0123456789ABCDEF",
      "lxinit:70 0010  7f 80 7e 20 0a                                   ..~ .",
      "lxinit:71 Two\\nlines: 1 byte",
      "lxinit:71 0000  78                                               x",
      "lxinit:72 Empty: 0 bytes",
      "lxinit:73 None: null, 0 bytes",
  };
  EXPECT_EQ(trace_texts(contents(path)), expected);
  EXPECT_EQ(fs::status(path).permissions() & fs::perms(0077), fs::perms::none);
}

TEST(Trace, HeadTellsTimeAndThread) {
  TemporaryDirectory directory;
  const std::string path = directory / "trace";
  RAS1_Unit unit = RAS1_UNIT("alpha");
  RAS1_Configure("*=ff", path.c_str());
  const time_t before = time(nullptr);
  pid_t thread_id = 0;
  std::thread([&] {
    thread_id = gettid();
    RAS1_Printf(&unit, 1, "x");
  }).join();
  const time_t after = time(nullptr);
  RAS1_Configure(nullptr, nullptr);

  const std::string line = contents(path);
  tm utc = {};
  const char* rest = strptime(line.c_str(), "%Y-%m-%dT%H:%M:%S", &utc);
  ASSERT_NE(rest, nullptr) << line;
  const time_t written = timegm(&utc);
  EXPECT_LE(before - 1, written);  // time() may lag behind the clock by a tick
  EXPECT_LE(written, after + 1);
  EXPECT_EQ(std::string(rest).substr(7), "Z " + std::to_string(thread_id) + " alpha:1 x\n");
}

TEST(Trace, LongMessagesAreCut) {
  TemporaryDirectory directory;
  const std::string path = directory / "trace";
  RAS1_Unit unit = RAS1_UNIT("alpha");
  RAS1_Configure("*=ff", path.c_str());
  for (size_t bytes = 1900; bytes < 2100; ++bytes)
    RAS1_Printf(&unit, 1, "%s\n", std::string(bytes, 'a').c_str());
  RAS1_Printf(&unit, 1, "%s", std::string(2000, '\n').c_str());  // grows when it is spelled out
  RAS1_Configure(nullptr, nullptr);

  const std::vector<std::string> texts = trace_texts(contents(path));
  ASSERT_EQ(texts.size(), 201u);
  size_t whole_bytes = 1900;  // of the next message, as long as messages are whole
  while (texts[whole_bytes - 1900] == "alpha:1 " + std::string(whole_bytes, 'a')) ++whole_bytes;
  EXPECT_GT(whole_bytes, 1950u);
  for (size_t i = whole_bytes - 1900; i < 200; ++i)
    ASSERT_EQ(texts[i], "alpha:1 " + std::string(whole_bytes - 1, 'a') + "...") << i;
  // The cut may fall inside the "\n" of the spelling, depending on how many digits the thread's number has.
  const std::string last = lines_of(contents(path)).back();
  EXPECT_EQ(last.size(), 2046u);
  EXPECT_EQ(last.substr(last.size() - 3), "...");
}

int role_levels() {
  RAS1_Unit alpha = RAS1_UNIT("alpha"), beta = RAS1_UNIT("beta"), gamma = RAS1_UNIT("gamma");
  for (int i = 0; i < 2; ++i) printf("%x %x %x\n", RAS1_Sync(&alpha), RAS1_Sync(&beta), RAS1_Sync(&gamma));
  return 0;
}

TEST(Trace, LevelsFromTheEnvironment) {
  const std::string long_name(40, 'n');
  const struct {
    std::string list;
    const char* levels;
    std::string complaints;
  } kCases[] = {
      {"", "0 0 0", ""},
      {"alpha=0xD8,beta=ff,*=80", "d8 ff 80", ""},
      {"*=80,alpha=0XfF", "ff 80 80", ""},
      {" alpha = 1c , ,beta=0,*=100,", "1c 0 100", ""},
      {"alpha=1,*=2,alpha=4,*=8", "4 8 8", ""},
      {"alphabet=ff,alph=ff,ALPHA=ff", "0 0 0", ""},
      {"alpha=ffffffff", "ffffffff 0 0", ""},
      {"alpha=1,beta,gamma=4", "1 0 4",
       "LX_TRACE: column 9: no \"=\" between unit and level; ignored: \"beta\"\n"},
      {"alpha=8g, beta=", "0 0 0",
       "LX_TRACE: column 1: the level is not a hexadecimal number; ignored: \"alpha=8g\"\n"
       "LX_TRACE: column 11: no level after \"=\"; ignored: \"beta=\"\n"},
      {"=80,beta=0x", "0 0 0",
       "LX_TRACE: column 1: no unit before \"=\"; ignored: \"=80\"\n"
       "LX_TRACE: column 5: no level after \"=\"; ignored: \"beta=0x\"\n"},
      {"alpha=100000000", "0 0 0",
       "LX_TRACE: column 1: the level has more than 32 bits; ignored: \"alpha=100000000\"\n"},
      {long_name + "=1,beta=2", "0 2 0",
       "LX_TRACE: column 1: the unit's name is too long; ignored: \"" + long_name + "=1\"\n"},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.list);
    const Outcome outcome = run_role("levels", {"LX_TRACE=" + c.list});
    EXPECT_EQ(outcome.out, std::string(c.levels) + "\n" + c.levels + "\n");
    EXPECT_EQ(outcome.err, c.complaints);
  }
  std::string many;
  for (int i = 0; i < 64; ++i) many += "u" + std::to_string(i) + "=1,";
  const Outcome outcome = run_role("levels", {"LX_TRACE=" + many + "alpha=1"});
  EXPECT_NE(outcome.err.find("too many entries; ignored: \"alpha=1\"\n"), std::string::npos) << outcome.err;
}

int role_message() {
  RAS1_Unit alpha = RAS1_UNIT("alpha");
  errno = 4711;
  if (RAS1_Sync(&alpha) != 0) {
    RAS1_Printf(&alpha, 1, "one");
    RAS1_Printf(&alpha, 2, "two");
  }
  return errno == 4711 ? 0 : 1;  // even when the file cannot be opened
}

TEST(Trace, SinkFromTheEnvironment) {
  using Texts = std::vector<std::string>;
  TemporaryDirectory directory;
  const std::string path = directory / "trace", missing = directory / "missing/trace";
  const std::string on = "LX_TRACE=*=80", file = "LX_TRACE_FILE=";
  const Texts both = {"alpha:1 one", "alpha:2 two"};

  run_role("message", {file + path});
  run_role("message", {"LX_TRACE=beta=ff", file + path});
  EXPECT_FALSE(fs::exists(path));  // tracing is off
  run_role("message", {on, file + path});
  EXPECT_EQ(trace_texts(contents(path)), both);
  run_role("message", {on, file + path});
  EXPECT_EQ(lines_of(contents(path)).size(), 4u);  // appended

  // What cannot be opened is reported once, before the first line.
  const std::string instead = "; tracing to standard error instead of \"";
  const std::string no_file = "LX_TRACE_FILE: No such file or directory" + instead + missing + "\"";
  const std::string too_long = "LX_TRACE_FILE: the path is too long" + instead;
  const struct {
    Texts variables, out, err;
  } kCases[] = {
      {{on}, {}, both},
      {{on, file}, {}, both},
      {{on, file + "stderr"}, {}, both},
      {{on, file + "stdout"}, both, {}},
      {{on, file + missing}, {}, {no_file, both[0], both[1]}},
      {{on, file + std::string(5000, 'p')}, {}, {too_long, both[0], both[1]}},
  };
  for (const auto& c : kCases) {
    const Outcome outcome = run_role("message", c.variables);
    EXPECT_EQ(outcome.exit_code, 0);
    EXPECT_EQ(trace_texts(outcome.out), c.out);
    Texts err = trace_texts(outcome.err);
    if (!err.empty() && err[0].size() > 1000) err[0].resize(too_long.size());
    EXPECT_EQ(err, c.err);
  }
}

int role_writer() {
  RAS1_Unit unit = RAS1_UNIT("alpha");
  RAS1_Sync(&unit);
  in_eight_threads([&](int i) {
    const std::string text(static_cast<size_t>(100 + 50 * i), static_cast<char>('a' + i));
    for (int k = 0; k < 100; ++k) RAS1_Printf(&unit, i, "%s", text.c_str());
  });
  return 0;
}

// Four processes of eight threads append to one file.
TEST(Trace, LinesDoNotMix) {
  TemporaryDirectory directory;
  const std::string path = directory / "trace", out = directory / "out", err = directory / "err";
  const std::vector<std::string> variables = {"LX_TRACE=*=80", "LX_TRACE_FILE=" + path};
  pid_t children[4];
  for (pid_t& child : children) child = start_role("/proc/self/exe", "writer", variables, out, err);
  for (pid_t child : children) EXPECT_EQ(exit_code_of(child), 0);

  int counts[8] = {};
  for (const std::string& text : trace_texts(contents(path))) {
    const int i = text.size() > 6 ? text[6] - '0' : -1;
    ASSERT_TRUE(i >= 0 && i < 8) << text;
    const std::string expected(static_cast<size_t>(100 + 50 * i), static_cast<char>('a' + i));
    ASSERT_EQ(text, "alpha:" + std::to_string(i) + " " + expected);
    ++counts[i];
  }
  for (int count : counts) EXPECT_EQ(count, 4 * 100);
}

const struct {
  const char* name;
  int (*run)();
} kRoles[] = {
    {"environment", role_environment},
    {"end_order", role_end_order},
    {"end_waits", role_end_waits},
    {"exit_in_process_init", role_exit_in_process_init},
    {"exit_in_thread_init", role_exit_in_thread_init},
    {"exit_in_thread_term", role_exit_in_thread_term},
    {"levels", role_levels},
    {"message", role_message},
    {"writer", role_writer},
};

}  // namespace

int main(int argc, char** argv) {
  if (argc == 3 && strcmp(argv[1], "--role") == 0) {
    alarm(60);  // a role that hangs fails
    for (const auto& role : kRoles)
      if (strcmp(role.name, argv[2]) == 0) return role.run();
    return 99;
  }
  testing::InitGoogleTest(&argc, argv);
  return RUN_ALL_TESTS();
}
