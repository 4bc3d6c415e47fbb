// Each turn is a process of its own: forked, so that the program is loaded and nothing of a library has been used.
#include "first_use.h"

#include <locale.h>
#include <lx.h>
#include <monetary.h>
#include <sys/wait.h>
#include <unicode/ucnv.h>
#include <unicode/ucol.h>
#include <unicode/unum.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <string>
#include <vector>

namespace bench {
namespace {

constexpr int kTurns = 60;
constexpr char kWord[] =
    "Gr\xC3\xB6\xC3\x9F"
    "e";
constexpr char kOther[] = "Gro\xC3\x9F";
constexpr double kAmount = 1234567.89;

/// Whether all of it could be done.
using Work = std::function<bool()>;

bool use_lexicor(const char* directory, const char* name) {
  if (LXInit(directory, nullptr, nullptr, nullptr, 0) != LX_OK) return false;
  LXLocale* const locale = LXGetLocale(name, 0, nullptr);
  if (locale == nullptr) return false;
  LXUChar units[16];
  char text[64];
  return LXStringToUnicode(units, 16, locale, kWord, -1, 0) > 0 &&
         LXStrcoll(locale, kWord, -1, kOther, -1, 0) != 0 &&
         LXCurrencyToString(locale, kAmount, text, sizeof text, 0) > 0;
}

bool use_icu() {
  UErrorCode error = U_ZERO_ERROR;
  char16_t units[64];
  ucnv_toUChars(ucnv_open("UTF-8", &error), units, 64, kWord, -1, &error);
  const UCollationResult order = ucol_strcollUTF8(ucol_open("de", &error), kWord, -1, kOther, -1, &error);
  unum_formatDouble(unum_open(UNUM_CURRENCY, nullptr, 0, "de_DE", nullptr, &error), kAmount, units, 64, nullptr,
                    &error);
  return U_SUCCESS(error) && order != UCOL_EQUAL;
}

bool use_glibc() {
  if (setlocale(LC_ALL, "de_DE.UTF-8") == nullptr) return false;
  wchar_t wide[16];
  char text[64];
  return mbstowcs(wide, kWord, 16) > 0 && strcoll(kWord, kOther) != 0 &&
         strfmon(text, sizeof text, "%n", kAmount) > 0;
}

/// Memory that is this process's own, in kilobytes.
long private_kilobytes() {
  long kilobytes = 0;
  if (std::FILE* const file = std::fopen("/proc/self/smaps_rollup", "r")) {
    for (char line[128]; std::fgets(line, sizeof line, file) != nullptr;)
      if (std::sscanf(line, "Private_Dirty: %ld", &kilobytes) == 1) break;
    std::fclose(file);
  }
  return kilobytes;
}

struct Turn {
  double microseconds;
  long kilobytes;
  bool done;
};

Turn take_turn(const Work& work) {
  const long before = private_kilobytes();
  const auto start = std::chrono::steady_clock::now();
  const bool done = work();
  const std::chrono::duration<double, std::micro> time = std::chrono::steady_clock::now() - start;
  return {time.count(), private_kilobytes() - before, done};
}

Turn in_a_process(const Work& work) {
  Turn turn{};
  int ends[2];
  if (pipe(ends) != 0) return turn;
  const pid_t child = fork();
  if (child == 0) {
    turn = take_turn(work);
    _exit(write(ends[1], &turn, sizeof turn) == sizeof turn ? 0 : 1);
  }
  close(ends[1]);
  if (child < 0 || read(ends[0], &turn, sizeof turn) != sizeof turn) turn.done = false;
  close(ends[0]);
  waitpid(child, nullptr, 0);
  return turn;
}

}  // namespace

void print_first_use(const char* locale_directory, std::FILE* out) {
  const auto lexicor = [=](const char* name) { return [=] { return use_lexicor(locale_directory, name); }; };
  struct Peer {
    const char* name;
    Work work;
    std::vector<Turn> turns;
  } peers[] = {{"lexicor, UTF-8", lexicor("German_Germany.UTF-8@Default"), {}},
               {"lexicor, Latin1", lexicor("German_Germany.Latin1@Default"), {}},
               {"ICU", use_icu, {}},
               {"glibc", use_glibc, {}}};
  for (int i = 0; i < kTurns; ++i)
    for (Peer& peer : peers) peer.turns.push_back(in_a_process(peer.work));
  for (Peer& peer : peers) {
    std::sort(peer.turns.begin(), peer.turns.end(),
              [](const Turn& a, const Turn& b) { return a.microseconds < b.microseconds; });
    const Turn &least = peer.turns.front(), &median = peer.turns[kTurns / 2];
    if (least.done)
      std::fprintf(out, "%-16s %6.0f %6.0f us %6ld kB\n", peer.name, least.microseconds, median.microseconds,
                   median.kilobytes);
    else
      std::fprintf(out, "%-16s cannot: its locale is not there\n", peer.name);
  }
}

}  // namespace bench
