// Time and memory from a fresh process to the first conversion, comparison and amount. Each turn is a process
// of its own: forked, so that the program is loaded and nothing of a library has been used.
#include <locale.h>
#include <monetary.h>
#include <sys/wait.h>
#include <unistd.h>
#include <wchar.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <limits>

#include "families.h"
#include "icu.h"
#include "lx.h"

namespace bench {
namespace {

constexpr int kTurns = 60;
constexpr char kWord[] = "Gr\xC3\xB6\xC3\x9F\x65";
constexpr char kOther[] = "Gro\xC3\x9F";
constexpr double kAmount = 1234567.89;

/// Whether all of it could be done.
using FirstUse = std::function<bool()>;

/// The library is not initialised yet in the process that forks.
FirstUse use_lexicor(const std::string& directory, const std::string& name) {
  return [directory, name] {
    if (LXInit(directory.c_str(), nullptr, nullptr, nullptr, 0) != LX_OK) return false;
    LXLocale* const locale = LXGetLocale(name.c_str(), 0, nullptr);
    if (locale == nullptr) return false;
    LXUChar units[16];
    char text[64];
    return LXStringToUnicode(units, 16, locale, kWord, -1, 0) > 0 &&
           LXStrcoll(locale, kWord, -1, kOther, -1, 0) != 0 &&
           LXCurrencyToString(locale, kAmount, text, sizeof text, 0) > 0;
  };
}

bool use_glibc() {
  if (setlocale(LC_ALL, "de_DE.UTF-8") == nullptr) return false;
  wchar_t wide[16];
  char text[64];
  return mbstowcs(wide, kWord, 16) > 0 && strcoll(kWord, kOther) != 0 &&
         strfmon(text, sizeof text, "%n", kAmount) > 0;
}

/// Memory that is in no file, in kilobytes. What is private and what shared is a guess of newer systems.
long own_kilobytes() {
  long kilobytes = 0;
  if (std::FILE* const file = std::fopen("/proc/self/smaps_rollup", "r")) {
    for (char line[128]; std::fgets(line, sizeof line, file) != nullptr;)
      if (std::sscanf(line, "Anonymous: %ld", &kilobytes) == 1) break;
    std::fclose(file);
  }
  return kilobytes;
}

struct Turn {
  double ns;
  long kilobytes;
  bool done;
};

Turn take_turn(const FirstUse& use) {
  const long before = own_kilobytes();
  const auto start = std::chrono::steady_clock::now();
  const bool done = use();
  const std::chrono::duration<double, std::nano> time = std::chrono::steady_clock::now() - start;
  return {time.count(), own_kilobytes() - before, done};
}

Turn in_a_process(const FirstUse& use) {
  Turn turn{};
  int ends[2];
  if (pipe(ends) != 0) return turn;
  const pid_t child = fork();
  if (child == 0) {
    turn = take_turn(use);
    _exit(write(ends[1], &turn, sizeof turn) == sizeof turn ? 0 : 1);
  }
  close(ends[1]);
  if (child < 0 || read(ends[0], &turn, sizeof turn) != sizeof turn) turn.done = false;
  close(ends[0]);
  waitpid(child, nullptr, 0);
  return turn;
}

struct Competitor {
  const char* name;
  FirstUse use;
  Turn least = {std::numeric_limits<double>::max(), 0, false};
};

void add_row(Table* table, const std::string& name, std::vector<Competitor> competitors) {
  for (int i = 0; i < kTurns; ++i)
    for (Competitor& competitor : competitors) {
      const Turn turn = competitor.use ? in_a_process(competitor.use) : Turn{};
      if (turn.done && turn.ns < competitor.least.ns) competitor.least = turn;
    }
  std::vector<Measured> measured;
  std::string memory;
  for (const Competitor& competitor : competitors) {
    if (!competitor.least.done) continue;
    measured.push_back({competitor.name, competitor.least.ns, true});
    memory += (memory.empty() ? "" : ", ") + std::string(competitor.name) + " " +
              std::to_string(competitor.least.kilobytes) + " kB";
  }
  if (competitors.front().least.done) table->print(name, measured, 1, 1, memory);
}

}  // namespace

void add_first_use_rows(Table* table, const std::string& locale_directory) {
  for (const char* const codepage : {"UTF-8", "Latin1"}) {
    const std::string name = std::string("first-use/") + codepage;
    const std::string locale = std::string("German_Germany.") + codepage + "@Default";
    if (table->wants(name))
      add_row(table, name,
              {{kOurs, use_lexicor(locale_directory, locale)},
               {kIcu, icu::first_use(kWord, kOther, kAmount)},
               {kGlibc, use_glibc}});
  }
}

}  // namespace bench
