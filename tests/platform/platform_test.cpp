// The standalone platform layer: locks, environment, once-only blocks and trace. What happens at the start or
// the end of a process is observed in another process: the test program runs itself again in a role (see kRoles
// at the end). One file, although it is long, because the roles need one main function.
#include <gtest/gtest.h>
#include <pthread.h>
#include <sys/auxv.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <map>
#include <mutex>
#include <regex>
#include <set>
#include <sstream>
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

struct Outcome {
  int exit_code;  // -1: ended by a signal
  std::string out, err;
};

Outcome run_role(const std::string& role, const std::vector<std::string>& variables = {},
                 const std::string& program = fs::read_symlink("/proc/self/exe").string()) {
  TemporaryDirectory directory;
  const std::string out = directory / "out", err = directory / "err";
  std::string command = "exec env -u LX_PROBE -u LX_TRACE -u LX_TRACE_FILE";
  for (const std::string& variable : variables) command += " '" + variable + "'";
  command += " '" + program + "' --role " + role + " >'" + out + "' 2>'" + err + "'";
  const int status = system(command.c_str());
  return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, contents(out), contents(err)};
}

/// For roles that are about the end of the process: goes past stdio, whose buffers are flushed at an unknown
/// point.
void say(const char* text) {
  if (write(STDOUT_FILENO, text, strlen(text)) < 0) abort();
}

// ---- Locks and environment

TEST(Lock, ExcludesOtherThreads) {
  BSS1_Lock lock, other;
  for (BSS1_Lock* each : {&lock, &other}) ASSERT_EQ(BSS1_InitializeLock(each), 0);
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
  for (BSS1_Lock* each : {&lock, &other}) EXPECT_EQ(BSS1_DestroyLock(each), 0);
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
  EXPECT_EQ(run_role("environment").out, "secure=0 probe=(null) level=0\n");
  EXPECT_EQ(run_role("environment", variables).out, "secure=0 probe=x level=ff\n");

  if (geteuid() != 0) GTEST_SKIP() << "only root can give a program to another user";
  TemporaryDirectory directory;
  const std::string program = directory / "program";
  fs::copy_file("/proc/self/exe", program);
  ASSERT_EQ(chown(program.c_str(), 65534, 65534), 0);
  ASSERT_EQ(chmod(program.c_str(), 04755), 0);
  const Outcome outcome = run_role("environment", variables, program);
  if (outcome.out.find("secure=1") == std::string::npos)
    GTEST_SKIP() << "set-user-id programs do not work here: " << outcome.out << outcome.err;
  EXPECT_EQ(outcome.out, "secure=1 probe=(null) level=0\n");
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

struct ThreadProbe {
  pthread_t owner;
  void* process_block;
};

std::atomic<int> first_inits{0}, first_terms{0}, late_terms{0};
thread_local int second_terms_here = 0;
BSS1_ProcessBlock base_block = BSS1_PROCESS_BLOCK(nullptr, nullptr, 1);
const BSS1_ThreadBlock late_block = BSS1_THREAD_BLOCK(
    nullptr, [](void*) { ++late_terms; }, 1);
extern const BSS1_ThreadBlock first_block, second_block;

void init_first(void* block) {
  ThreadProbe* probe = static_cast<ThreadProbe*>(block);
  EXPECT_EQ(probe->process_block, nullptr);  // blocks begin zeroed
  EXPECT_EQ(BSS1_ResolveThread(&first_block), block);
  *probe = {pthread_self(), BSS1_ResolveProcess(&base_block)};
  ++first_inits;
}

void term_first(void* block) {
  EXPECT_TRUE(pthread_equal(static_cast<ThreadProbe*>(block)->owner, pthread_self()));
  EXPECT_EQ(BSS1_ResolveThread(&first_block), block);  // not a second block
  EXPECT_EQ(BSS1_ResolveProcess(&base_block), static_cast<ThreadProbe*>(block)->process_block);
  EXPECT_EQ(second_terms_here, 1);                      // the last one made ends first
  EXPECT_NE(BSS1_ResolveThread(&late_block), nullptr);  // which the thread never had: that one must end too
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
  first_inits = first_terms = late_terms = 0;
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
  EXPECT_EQ(first_inits, 8);
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
  return BSS1_ResolveProcess(&block) != nullptr;
}

int role_exit_in_thread_init() {
  static const BSS1_ThreadBlock block =
      BSS1_THREAD_BLOCK([](void*) { exit(3); }, [](void*) { say("end half-made\n"); }, 1);
  BSS1_ResolveThread(&speaking_block);
  return BSS1_ResolveThread(&block) != nullptr;
}

int role_exit_in_thread_term() {
  static const BSS1_ThreadBlock block = BSS1_THREAD_BLOCK(
      nullptr, [](void*) { exit(3); }, 1);
  std::thread([] { BSS1_ResolveThread(&speaking_block), BSS1_ResolveThread(&block); }).join();
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

/// The lines without their time and thread; a line that does not begin with them is whole.
std::vector<std::string> trace_texts(const std::string& trace) {
  static const std::regex head(R"(^\d{4}-\d\d-\d\dT\d\d:\d\d:\d\d\.\d{6}Z \d+ )");
  std::vector<std::string> texts;
  std::istringstream in(trace);
  for (std::string line; std::getline(in, line);)
    texts.push_back(std::regex_replace(in.eof() ? line + "<no newline>" : line, head, ""));
  return texts;
}

TEST(Trace, FormatOfLines) {
  TemporaryDirectory directory;
  const std::string path = directory / "trace";
  RAS1_Unit unit = RAS1_UNIT("lxinit");
  RAS1_Configure("lxinit=d8", path.c_str());
  EXPECT_EQ(RAS1_Sync(&unit), 0xD8u);
  EXPECT_EQ(unit.level, 0xD8u);
  EXPECT_EQ(unit.seen, RAS1_ChangeCounter);
  EXPECT_FALSE(fs::exists(path));  // there was nothing to write yet

  const time_t before = time(nullptr);
  pid_t thread_id = 0;
  std::thread([&] { thread_id = gettid(), RAS1_Printf(&unit, 4, "%s", ""); }).join();
  const time_t after = time(nullptr);
  errno = 4711;
  RAS1_Event(&unit, 57, RAS1_EVENT_ENTRY, 99);
  RAS1_Event(&unit, 58, RAS1_EVENT_EXIT_VALUE, 0);
  RAS1_Event(&unit, 60, RAS1_EVENT_EXIT_VALUE, -1);
  RAS1_Event(&unit, 61, RAS1_EVENT_EXIT, 99);
  RAS1_Printf(&unit, 1, "Lexicor init count = %d", 3);
  RAS1_Printf(&unit, 2, "Ends with a newline %s\n", "of its own");
  RAS1_Printf(&unit, 3, "Path: %s\n file:\t%s\x7F", "a\\b", "\xC3\xA4");
  RAS1_Dump(&unit, 70, "0123456789ABCDEF\x7F\x80~ \n", 21, "String1");
  RAS1_Dump(&unit, 71, "x", 1, "Two\nlines");
  RAS1_Dump(&unit, 72, "x", 0, "Empty");
  RAS1_Dump(&unit, 73, nullptr, 5, "None");
  EXPECT_EQ(errno, 4711);
  RAS1_Configure(nullptr, nullptr);
  EXPECT_NE(unit.seen, RAS1_ChangeCounter);
  EXPECT_EQ(RAS1_Sync(&unit), 0u);

  const std::vector<std::string> expected = {
      "lxinit:4 ",
      "lxinit:57 entry",
      "lxinit:58 exit 0x0",
      sizeof(intptr_t) == 8 ? "lxinit:60 exit 0xffffffffffffffff" : "lxinit:60 exit 0xffffffff",
      "lxinit:61 exit",
      "lxinit:1 Lexicor init count = 3",
      "lxinit:2 Ends with a newline of its own",
      "lxinit:3 Path: a\\b\\n file:\\x09\xC3\xA4\\x7f",
      "lxinit:70 String1: 21 bytes",
      "lxinit:70 0000  30 31 32 33 34 35 36 37 38 39 41 42 43 44 45 46  0123456789ABCDEF",
      "lxinit:70 0010  7f 80 7e 20 0a                                   ..~ .",
      "lxinit:71 Two\\nlines: 1 byte",
      "lxinit:71 0000  78                                               x",
      "lxinit:72 Empty: 0 bytes",
      "lxinit:73 None: null, 0 bytes"};
  const std::string trace = contents(path);
  EXPECT_EQ(trace_texts(trace), expected);
  auto second = [](time_t at) {
    char text[32];
    tm utc;
    return std::string(text, strftime(text, sizeof(text), "%FT%T", gmtime_r(&at, &utc)));
  };
  EXPECT_GE(trace, second(before - 1));  // time() may lag behind the clock by a tick
  EXPECT_LE(trace, second(after + 2));
  EXPECT_EQ(trace.substr(26, trace.find('\n') - 26), "Z " + std::to_string(thread_id) + " lxinit:4 ");
  EXPECT_EQ(fs::status(path).permissions() & fs::perms(0077), fs::perms::none);
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
  const std::string trace = contents(path);
  EXPECT_EQ(trace.size() - trace.rfind('\n', trace.size() - 2) - 1, 2047u);
  EXPECT_EQ(trace.substr(trace.size() - 4), "...\n");
}

TEST(Trace, ListOfLevels) {
  std::string many;
  for (int i = 0; i < 64; ++i) many += "u" + std::to_string(10 + i) + "=1,";
  const struct {
    std::string list;
    const char* levels;
    std::vector<const char*> complaints;
  } kCases[] = {
      {"*=80,alpha=0XfFffFFff", "ffffffff 80 80", {}},
      {" alpha = 1c , ,beta=0,*=100,", "1c 0 100", {}},
      {"alpha=1,*=2,alpha=4,*=8", "4 8 8", {}},
      {"alphabet=ff,alph=ff,ALPHA=ff", "0 0 0", {}},
      {"alpha=1,beta,gamma=4", "1 0 4", {"9: no \"=\" between unit and level; ignored: \"beta\""}},
      {"alpha=8g, beta=",
       "0 0 0",
       {"1: the level is not a hexadecimal number; ignored: \"alpha=8g\"",
        "11: no level after \"=\"; ignored: \"beta=\""}},
      {"=80,beta=0x",
       "0 0 0",
       {"1: no unit before \"=\"; ignored: \"=80\"", "5: no level after \"=\"; ignored: \"beta=0x\""}},
      {"alpha=100000000", "0 0 0", {"1: the level has more than 32 bits; ignored: \"alpha=100000000\""}},
      {"a23456789012345678901234567890_2=1,beta=2",
       "0 2 0",
       {"1: the unit's name is too long; ignored: \"a23456789012345678901234567890_2=1\""}},
      {many + "alpha=1", "0 0 0", {"385: too many entries; ignored: \"alpha=1\""}},
  };
  for (const auto& c : kCases) {
    SCOPED_TRACE(c.list);
    RAS1_Unit alpha = RAS1_UNIT("alpha"), beta = RAS1_UNIT("beta"), gamma = RAS1_UNIT("gamma");
    std::string complaints;
    for (const char* complaint : c.complaints)
      complaints += std::string("LX_TRACE: column ") + complaint + "\n";
    char levels[64];
    testing::internal::CaptureStderr();
    RAS1_Configure(c.list.c_str(), nullptr);
    sprintf(levels, "%x %x %x", RAS1_Sync(&alpha), RAS1_Sync(&beta), RAS1_Sync(&gamma));
    EXPECT_EQ(testing::internal::GetCapturedStderr(), complaints);
    EXPECT_STREQ(levels, c.levels);
  }
  RAS1_Configure(nullptr, nullptr);
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

  run_role("message", {"LX_TRACE=beta=ff", file + path});
  EXPECT_FALSE(fs::exists(path));  // tracing is off
  run_role("message", {on, file + path});
  EXPECT_EQ(trace_texts(contents(path)), both);
  run_role("message", {on, file + path});
  EXPECT_EQ(trace_texts(contents(path)).size(), 4u);  // appended

  // What cannot be opened is reported once, before the first line.
  const std::string instead = "; tracing to standard error instead of \"";
  const std::string no_file = "LX_TRACE_FILE: No such file or directory" + instead + missing + "\"";
  const std::string too_long = "LX_TRACE_FILE: the path is too long" + instead;
  const std::string pipe = directory / "pipe";
  ASSERT_EQ(mkfifo(pipe.c_str(), 0600), 0);
  const std::string no_reader = "LX_TRACE_FILE: No such device or address" + instead + pipe + "\"";
  const struct {
    Texts variables, out, err;
  } kCases[] = {
      {{on}, {}, both},
      {{on, file + "stderr"}, {}, both},
      {{on, file + "stdout"}, both, {}},
      {{on, file + missing}, {}, {no_file, both[0], both[1]}},
      {{on, file + pipe}, {}, {no_reader, both[0], both[1]}},
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

std::string writer_text(int i) {
  return std::string(static_cast<size_t>(100 + 50 * i), static_cast<char>('a' + i));
}

int role_writer() {
  RAS1_Unit unit = RAS1_UNIT("alpha");
  RAS1_Sync(&unit);
  in_eight_threads([&](int i) {
    for (int k = 0; k < 100; ++k) RAS1_Printf(&unit, i, "%s", writer_text(i).c_str());
  });
  return 0;
}

// Four processes of eight threads append to one file.
TEST(Trace, LinesDoNotMix) {
  TemporaryDirectory directory;
  const std::string path = directory / "trace";
  std::vector<std::thread> processes;
  for (int i = 0; i < 4; ++i)
    processes.emplace_back([&] {
      EXPECT_EQ(run_role("writer", {"LX_TRACE=*=80", "LX_TRACE_FILE=" + path}).exit_code, 0);
    });
  for (std::thread& process : processes) process.join();

  std::map<std::string, int> counts, expected;
  for (const std::string& text : trace_texts(contents(path))) ++counts[text];
  for (int i = 0; i < 8; ++i) expected["alpha:" + std::to_string(i) + " " + writer_text(i)] = 4 * 100;
  EXPECT_EQ(counts, expected);
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
