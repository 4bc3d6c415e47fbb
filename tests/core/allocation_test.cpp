// Every function that allocates, with each of its allocations failing in turn: it gives the memory code or
// succeeds, nothing changes, nothing is lost, and the next try succeeds.
#include <cstring>

#include "core/tiny_directory.h"
#include "support/catalog_builder.h"
#include "support/forms.h"
#include "support/system_locale.h"

namespace lx::test {
namespace {

constexpr char kEverything[] = "English_Elsewhere.TINY-SHIFT@Default";

/// What a call may do where memory fails, beside giving LX_E_MEMORY and leaving all as it was.
enum Leave : uint32_t {
  kStrict = 0,
  kLoads = 1,   // objects stay loaded
  kCopes = 2,   // it works without the block
  kOutside = 4  // it starts without the library
};

using Call = std::function<int32_t(LXLocale*)>;  // gives the code

struct Row {
  const char* name;
  uint32_t leave;
  Call call;
  int32_t other = LX_E_MEMORY;  // a code that stands for no memory too
};

bool g_frees_fail = false;  // every free says that it did, though the block is gone
int32_t when_freed(int32_t well, int32_t failed) {
  return g_frees_fail ? failed : well;
}

/// What makes a locale, which is released.
Call makes(const std::function<LXLocale*(int32_t*)>& make) {
  return [=](LXLocale*) {
    int32_t rc = -1;
    LXLocale* locale = make(&rc);
    EXPECT_EQ(locale != nullptr, rc == LX_OK);
    EXPECT_EQ(LXReleaseLocale(locale), when_freed(0, 1));
    return rc;
  };
}
/// What leaves its code as the error, and whose result is not 0 when it has succeeded.
Call stores(const std::function<bool(LXLocale*)>& done) {
  return [=](LXLocale* locale) {
    const bool result = done(locale);
    EXPECT_EQ(LXGetError(locale) == LX_OK, result);
    return LXGetError(locale);
  };
}
Call loads(int32_t type, uint16_t id) {
  return [=](LXLocale*) {
    int32_t rc = -1;
    const LXObject* found = LXGetObjFromID(nullptr, type, id, LX_FIND_AND_LOAD, &rc);
    EXPECT_EQ(found != nullptr, rc == LX_OK);
    return rc;
  };
}

class AllocationTest : public LibraryTest {
 protected:
  void SetUp() override {
    LibraryTest::SetUp();
    write_tiny_directory(directory);
    directory.write("catalog", catalog_file({{3, {{4, std::string(300, 'm')}}}}));
  }

  /// Every item in the forms that show all of it.
  LXLocale* begin() {
    EXPECT_EQ(init(), LX_OK);
    EXPECT_EQ(LXSetLocale("English", 0), LX_OK);
    LXLocale* locale = LXGetLocale("English_UnitedStates.TINY-UTF8@Default", 0, nullptr);
    EXPECT_NE(locale, nullptr);
    return locale;
  }

  /// With allocation `n` failing, or none for 0, which shows what is done. False when there are fewer.
  bool fails(const Row& row, size_t n, bool from_then_on) {
    LXLocale* const locale = (row.leave & kOutside) == 0 ? begin() : nullptr;
    const std::string before = locale != nullptr ? state_of(locale) : "";
    const size_t blocks = hooks.live_blocks();
    hooks.fail_at(n, from_then_on);
    const int32_t code = row.call(locale);
    const bool failed = hooks.failed();
    hooks.fail_at(0);
    EXPECT_EQ(system.current, "C") << "the system's locale is put back";
    EXPECT_TRUE(code == LX_OK ? !failed || (row.leave & kCopes) != 0
                              : failed && (code == LX_E_MEMORY || code == row.other))
        << code;
    if (locale != nullptr && code == LX_OK && n == 0) {
      done_ = state_of(locale);
    } else if (locale != nullptr && code == LX_OK) {
      EXPECT_EQ(state_of(locale), done_);
    } else if (locale != nullptr) {
      EXPECT_EQ(state_of(locale), before);
      if ((row.leave & kLoads) == 0) {
        EXPECT_EQ(hooks.live_blocks(), blocks);
      }
      EXPECT_EQ(row.call(locale), LX_OK) << "a later try";
    }
    LXReleaseLocale(locale);
    terminate();
    EXPECT_EQ(hooks.live_blocks(), 0u);
    EXPECT_EQ(hooks.wrong_frees(), 0u);
    return failed;
  }

  void frees_fail(const Row& row) {
    SCOPED_TRACE(std::string(row.name) + ", failing frees");
    LXLocale* const locale = (row.leave & kOutside) == 0 ? begin() : nullptr;
    hooks.fail_frees(g_frees_fail = true);
    const int32_t code = row.call(locale);
    hooks.fail_frees(g_frees_fail = false);
    EXPECT_TRUE(code == LX_OK || code == LX_E_FREE) << code;
    if (locale != nullptr) {
      EXPECT_EQ(state_of(locale), done_);
    }
    LXReleaseLocale(locale);
    terminate();
    EXPECT_EQ(hooks.live_blocks(), 0u);
    EXPECT_EQ(hooks.wrong_frees(), 0u);
  }

  void expect_row(const Row& row) {
    fails(row, 0, false);
    frees_fail(row);
    for (bool from_then_on : {false, true}) {
      for (size_t n = 1;; ++n) {
        SCOPED_TRACE(std::string(row.name) + (from_then_on ? ", from allocation " : ", allocation ") +
                     std::to_string(n));
        if (!fails(row, n, from_then_on)) {
          EXPECT_GT(n, 1u) << "it allocates nothing";
          break;
        }
        ASSERT_FALSE(HasFailure());
      }
    }
  }

  SystemLocale system;

 private:
  std::string done_;  // the state that the row's call leaves
};

TEST_F(AllocationTest, EveryAllocationFails) {
  const std::string path = directory.path(), control = directory.file("control.nls"),
                    catalog = directory.file("catalog");
  const std::string long_text(400, 'a'), longer = long_text + "  ";
  const Units long_units = widened<LXUChar>(long_text + 'a'), capitals = Units(401, 'A'),
              catalog16 = widened<LXUChar>(catalog), missing16(400, 'd'),
              everything16 = widened<LXUChar>(kEverything + std::string(40, '-')),
              currency{0x3041, 0x3042, 0x3043, 'A'};
  const Text<LXWChar> everything32 = widened<LXWChar>(kEverything), long_codes(400, 'a');
  char grouping[] = "\3\3";
  lconv conventions = SystemLocale::nothing();
  conventions.grouping = grouping;
  system.known["de_DE"] = conventions;
  system.environment = "de_DE";
  const auto message = [=](uint32_t mode, bool found) {
    LXCatalog* opened = LXOpenCatalogU(nullptr, long_units.c_str(), catalog16.c_str(), mode);
    if (opened == nullptr) return LXGetError(nullptr);
    LXUChar text[500];
    const int32_t code = LXGetMessageU(opened, 3, found ? 4 : 9, text, 500, missing16.c_str());
    EXPECT_EQ(LXCloseCatalog(opened), LX_OK);
    return code;
  };
  const auto transfer = [](void*, char*, int32_t) { return 0; };
  uint8_t key[16];
  int32_t rc = -1;
  const Row rows[] = {
      {"LXInit, sort and language", kOutside | kCopes,
       [&](LXLocale* l) {
         int32_t code = init();
         const int32_t end = code == LX_OK ? when_freed(LX_OK, 1) : LX_E_NOT_INITIALIZED;
         if (code == LX_OK) code = loads(LX_SORT, kSortId)(l);
         if (code == LX_OK) code = loads(LX_LANGUAGE, 1)(l);
         EXPECT_EQ(LXTerm(), end);
         return code;
       },
       LX_E_NOT_INITIALIZED},
      {"LXInitObjManager", kCopes,
       [&](LXLocale*) {
         LXObjManager* own = LXInitObjManager(path.c_str(), 0, &rc);
         EXPECT_EQ(LXTermObjManager(own), own != nullptr ? when_freed(LX_OK, 1) : LX_E_INVALID);
         return rc;
       }},
      // Objects of the other types, and a codepage that is converted.
      {"territory", kLoads, loads(LX_TERRITORY, kElsewhereId)},
      {"codepage", kLoads, loads(LX_CODEPAGE, tiny_euc().file.id)},
      {"old codepage", kLoads, loads(LX_CODEPAGE, kOldId)},
      // Locales.
      {"LXGetLocale, user", kLoads,
       makes([&](int32_t* code) { return LXGetLocale(nullptr, LX_USER_LOCALE | LX_FALLBACK, code); })},
      {"LXGetLocaleW", kLoads,
       makes([&](int32_t* code) { return LXGetLocaleW(everything32.c_str(), 0, code); })},
      {"LXGetLocaleU", kLoads,
       makes([&](int32_t* code) { return LXGetLocaleU(everything16.c_str(), LX_FALLBACK, code); })},
      {"LXSetLocale", kLoads, [&](LXLocale*) { return LXSetLocale(kEverything, 0); }},
      {"LXConvertNativeLocale", kLoads | kCopes,
       makes([](int32_t* code) { return LXConvertNativeLocale("de_DE", LX_FALLBACK, code); })},
      // Items of a locale.
      {"territory of a locale", kLoads,
       stores([](LXLocale* l) { return LXSetLocaleNumInfo(l, 5, kElsewhereId); })},
      {"codepage of a locale", kLoads | kCopes,
       stores([](LXLocale* l) { return LXSetLocaleNumInfo(l, 9, tiny_shift().file.id); })},
      {"LXSetLocaleTextInfo", kCopes,
       stores([&](LXLocale* l) { return LXSetLocaleTextInfo(l, 81, long_text.c_str(), -1, 0); })},
      {"LXSetLocaleTextInfoU", kCopes,
       stores([&](LXLocale* l) { return LXSetLocaleTextInfoU(l, 64, currency.c_str(), -1, 0); })},
      {"LXSetLocaleTextInfoW", kCopes,
       stores([&](LXLocale* l) { return LXSetLocaleTextInfoW(l, 72, long_codes.data(), 300, 0); })},
      // Handles.
      {"LXOpenConversion", 0, stores([](LXLocale* l) {
         LXConversion* conversion = LXOpenConversion(l, nullptr);
         return conversion != nullptr && LXCloseConversion(conversion) == when_freed(LX_OK, LX_E_FREE);
       })},
      {"LXOpenStream", 0, stores([&](LXLocale* l) {
         LXStream* stream = LXOpenStream(l, transfer, nullptr, LX_STREAM_READ);
         return stream != nullptr && LXCloseStream(stream, l) == 1;
       })},
      {"LXOpenFile and LXLoadFile", 0,
       [&](LXLocale*) {
         LXFile* file = LXOpenFile(1, control.c_str(), LX_READ, 0, &rc);
         if (file == nullptr) return rc;
         LXUnloadFile(LXLoadFile(file, 0, 4, &rc));
         EXPECT_EQ(LXCloseFile(file, 0), when_freed(0, LX_E_FREE));
         return rc;
       }},
      {"messages", kCopes, [&](LXLocale*) { return message(0, true); }, LX_E_CATALOG},
      {"messages of a loaded catalog", kCopes, [&](LXLocale*) { return message(LX_CATALOG_LOAD, true); },
       LX_E_CATALOG},
      {"default messages", kCopes, [&](LXLocale*) { return message(0, false); }, LX_E_CATALOG},
      {"LXMcMalloc and LXMcRealloc", 0,
       [](LXLocale*) {
         void* const block = LXMcMalloc(4);
         if (block == nullptr) return LX_E_MEMORY;
         void* const larger = LXMcRealloc(block, 4, 8);
         EXPECT_EQ(LXMcFree(larger != nullptr ? larger : block), when_freed(1, 0));
         return larger != nullptr ? LX_OK : LX_E_MEMORY;
       }},
      // Texts that are longer than the stack's room.
      {"LXStrcmp, blanks", kCopes,
       [&](LXLocale*) {
         const int32_t result = LXStrcmp(nullptr, longer.c_str(), -1, long_text.c_str(), -1, LX_IGNORE_BLANKS);
         EXPECT_TRUE(result == 0 || (result == 2 && hooks.failed())) << "the blanks count";
         return LXGetError(nullptr);
       }},
      {"LXStrcollU", 0, stores([&](LXLocale* l) {
         const int32_t order = LXStrcollU(l, long_units.c_str(), -1, capitals.c_str(), -1, 0);
         EXPECT_EQ(order, hooks.failed() ? 0 : -1);
         return order != 0;
       })},
      {"LXStrcollU without case", 0, stores([&](LXLocale* l) {
         return LXStrcollU(l, capitals.c_str(), 400, long_units.c_str(), -1, LX_CASE_INSENSITIVE) < 0;
       })},
      {"LXStrxfrmU", 0,
       stores([&](LXLocale* l) { return LXStrxfrmU(l, key, sizeof(key), long_units.c_str(), -1, 0) >= 0; })},
      {"LXStrGenSortKey", 0,
       stores([&](LXLocale* l) { return LXStrGenSortKey(l, key, sizeof(key), long_units.c_str(), 400) >= 0; })},
  };
  for (const Row& row : rows) expect_row(row);
}

}  // namespace
}  // namespace lx::test
