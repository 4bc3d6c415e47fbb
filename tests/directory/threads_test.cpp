// Threads: first loads that race, locales that all share, locales and catalogs of their own, and uses of the library
// that come and go. Each call gives what it gives in one thread; the thread sanitizer sees all of it.
#include <gtest/gtest.h>

#include <atomic>
#include <cstdlib>
#include <cstring>
#include <random>
#include <thread>
#include <vector>

#include "support/catalog_builder.h"
#include "support/library.h"

namespace lx::test {
namespace {

constexpr int kThreads = 9;

/// How many calls each thread makes; more with LEXICOR_THREAD_CALLS.
size_t calls_of_thread() {
  const char* const given = std::getenv("LEXICOR_THREAD_CALLS");
  return given != nullptr ? std::strtoul(given, nullptr, 10) / kThreads : 3000;
}

constexpr const char* kLocales[] = {"German_Germany.UTF-8@Default", "Japanese_Japan.MS932@Japanese",
                                    "Japanese_Japan.IBM930@Default", "Danish_Denmark.Latin1@Danish",
                                    "Turkish_Turkey.UTF-8@BINARY"};
constexpr const char* kTexts[] = {u8"Straße, größer als 1.234,5", u8"日本語 カタカナ ﾊﾝｶｸ abc",
                                  u8"Ærø aa å Aalborg", ""};
constexpr uint32_t kOptions[] = {0, LX_CASE_INSENSITIVE, LX_WIDTH_INSENSITIVE};

struct Session {
  LXLocale* utf8;
  std::vector<LXLocale*> locales;
  std::string catalog;

  explicit Session(std::string path)
      : utf8(LXGetLocale("English.UTF-8", 0, nullptr)), catalog(std::move(path)) {
    for (const char* name : kLocales) locales.push_back(LXGetLocale(name, 0, nullptr));
  }
  ~Session() {
    for (LXLocale* locale : locales) LXReleaseLocale(locale);
    LXReleaseLocale(utf8);
  }
};

constexpr size_t kKinds = 11;
constexpr size_t kCalls =
    kKinds * std::size(kLocales) * std::size(kTexts) * std::size(kTexts) * std::size(kOptions);

/// What one of kCalls calls gives. `l` is its locale, which may be shared.
std::string outcome(const Session& session, size_t number, LXLocale* l) {
  const auto take = [&number](size_t count) {
    const size_t i = number % count;
    number /= count;
    return i;
  };
  take(std::size(kLocales));
  const auto text_of = [&](size_t i) {
    char text[200];
    const int32_t bytes = LXConvertString(l, text, sizeof text, session.utf8, kTexts[i],
                                          static_cast<int32_t>(std::strlen(kTexts[i])), 0);
    return std::string(text, static_cast<size_t>(bytes));
  };
  const std::string a = text_of(take(std::size(kTexts))), b = text_of(take(std::size(kTexts)));
  const uint32_t options = kOptions[take(std::size(kOptions))];
  const auto size = [](const std::string& text) { return static_cast<int32_t>(text.size()); };
  const auto sign = [](int32_t difference) { return std::to_string((difference > 0) - (difference < 0)); };
  char out[400];
  int32_t bytes = 0;
  switch (take(kKinds)) {
    case 0:
      return sign(LXStrcoll(l, a.data(), size(a), b.data(), size(b), options));
    case 1:
      return sign(LXStrcmp(l, a.data(), size(a), b.data(), size(b), options));
    case 2: {
      const std::string whole = a + b + b;
      const char* const found = LXStrstr(l, whole.data(), size(whole), b.data(), size(b), options);
      return found == nullptr ? "none" : std::to_string(found - whole.data());
    }
    case 3:
      bytes = LXStrxfrm(l, reinterpret_cast<uint8_t*>(out), sizeof out, a.data(), size(a), options);
      break;
    case 4:
      bytes = LXMapString(l, out, sizeof out, a.data(), size(a), options == 0 ? LX_MAP_LOWER : LX_MAP_UPPER);
      break;
    case 5:
      bytes = LXDoubleToString(l, -1234567.891, out, sizeof out, 0);
      break;
    case 6:
      bytes = LXCurrencyToString(l, 98765.432, out, sizeof out, options == 0 ? 0 : LX_INTERNATIONAL);
      break;
    case 7: {
      const LXTime time = {7, 5, 13, 29, 1, 124, 4, 59};
      bytes = LXTimeToString(l, &time, out, sizeof out, a.data(), size(a), 0);
      break;
    }
    case 8:
      bytes = LXGetLocaleTextInfo(l, LX_ITEM_DAY + size(a) % 40, out, sizeof out, 0);
      break;
    case 9: {
      const char* end = nullptr;
      const double value = LXStringToDouble(l, a.data(), size(a), &end, 0);
      return std::to_string(value) + " " + std::to_string(end - a.data());
    }
    default: {
      LXLocale* const own = LXGetLocale(kLocales[options % std::size(kLocales)], 0, nullptr);
      LXSetLocaleNumInfo(own, LX_ITEM_DIGITS, static_cast<int32_t>(options % 7));
      LXCatalog* const catalog =
          LXOpenCatalog(own, nullptr, session.catalog.c_str(), options == 0 ? LX_CATALOG_LOAD : 0);
      bytes = LXGetMessage(catalog, 1, 2, out, sizeof out, 0);
      LXCloseCatalog(catalog);
      LXReleaseLocale(own);
    }
  }
  return bytes < 0 ? "error" : std::string(out, static_cast<size_t>(bytes));
}

TEST(Threads, ShareLocalesAndLoadObjects) {
  const ScratchDirectory directory;
  directory.write("catalog", catalog_file({{1, {{2, "two"}}}}, "English.UTF-8"));
  std::vector<std::string> expected;
  {
    const Library library(LEXICOR_LOCALE_DIR);
    const Session session(directory.file("catalog"));
    for (size_t i = 0; i < kCalls; ++i)
      expected.push_back(outcome(session, i, session.locales[i % std::size(kLocales)]));
  }
  const Library library(LEXICOR_LOCALE_DIR);
  std::atomic<int> waiting{kThreads}, working{kThreads};
  std::atomic<const Session*> shared{nullptr};
  std::atomic<size_t> wrong{0};
  const auto work = [&](int thread) {
    std::minstd_rand random(static_cast<unsigned>(thread) + 1);
    --waiting;
    while (waiting != 0) std::this_thread::yield();
    const Session own(directory.file("catalog"));  // loads what the others load
    const Session* none = nullptr;
    shared.compare_exchange_strong(none, &own);
    const Session& session = *shared;
    for (size_t n = calls_of_thread(); n > 0; --n) {
      const size_t i = random() % kCalls;
      const bool use = i % 16 == 0;
      if (use) LXInit(LEXICOR_LOCALE_DIR, nullptr, nullptr, nullptr, LX_NO_DEFAULTS);
      wrong += outcome(session, i, session.locales[i % std::size(kLocales)]) != expected[i];
      if (use) LXTerm();
    }
    --working;
    while (working != 0) std::this_thread::yield();  // what is shared is released last
  };
  std::vector<std::thread> threads;
  for (int i = 0; i < kThreads; ++i) threads.emplace_back(work, i);
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(wrong, 0u);
}

}  // namespace
}  // namespace lx::test
