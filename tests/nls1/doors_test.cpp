// Every exported function as a door: what it answers, and what it writes, without the library, with undefined
// flags, and where no locale is given. The table holds every name of cmake/exports.txt once.
#include <fstream>
#include <set>
#include <sstream>
#include <tuple>

#include "core/library_fixture.h"
#include "nls1.h"
#include "nls1/failing_init.h"

namespace lx::test {
namespace {

constexpr int32_t kNothingStored = 99;

/// How a door is called.
struct Visit {
  LXLocale* locale;
  bool inside;    // the library is there, so handles are usable ones; else they crash when something reads them
  bool ordinary;  // empty texts, and zero for every number; else texts that crash when something reads them
  uint32_t flags = 0;  // the last argument
  int32_t number = 0;  // every other one, in an ordinary call
};

template <class T>
T* poison(size_t number = 0) {
  return reinterpret_cast<T*>(8 * (number + 1));
}
template <class R, class... P>
void fail_when_called(R (**callback)(P...)) {
  *callback = [](P...) {
    ADD_FAILURE() << "called";
    return R{};
  };
}

/// Arguments by their types. What a function may write to is a block of its own, whose bytes are known.
class Arguments {
 public:
  explicit Arguments(const Visit& visit) : visit_(visit) {}

  template <class T>
  T make(size_t at, bool last) {
    if constexpr (std::is_floating_point_v<T>) {
      return T{1};
    } else if constexpr (std::is_integral_v<T>) {
      return static_cast<T>(last ? static_cast<int64_t>(visit_.flags) : visit_.ordinary ? visit_.number : 10);
    } else if constexpr (std::is_function_v<std::remove_pointer_t<T>>) {
      T callback;
      fail_when_called(&callback);
      return callback;
    } else {
      using Target = std::remove_pointer_t<T>;
      const T pointer = make_pointer<std::remove_cv_t<Target>>(at, std::is_const_v<Target>);
      given_[at] = pointer;
      return pointer;
    }
  }

  /// The result and what was written: "null, #3=11". As a result "#1" is the argument that was given.
  template <class T>
  std::string outcome(T result) const {
    if constexpr (std::is_pointer_v<T>) {
      return name_of(result) + written();
    } else {
      return testing::PrintToString(result) + written();
    }
  }
  std::string written() const {
    std::string text;
    for (size_t i = 0; i < kMost; ++i) {
      const Block& block = blocks_[i];
      if (memcmp(block.bytes, block.before, kBlockBytes) == 0) continue;
      uintptr_t first = 0;
      memcpy(&first, block.bytes, std::min(block.unit_bytes, sizeof(first)));
      const size_t behind = kBlockBytes - block.unit_bytes;
      const bool more = memcmp(block.bytes + block.unit_bytes, block.before + block.unit_bytes, behind) != 0;
      text += ", #" + std::to_string(i) + "=" +
              (block.holds_pointer ? name_of(reinterpret_cast<void*>(first)) : std::to_string(first)) +
              (more ? " and more" : "");
    }
    return text;
  }

 private:
  static constexpr size_t kMost = 14, kBlockBytes = 64;
  struct Block {
    alignas(8) unsigned char bytes[kBlockBytes] = {};
    unsigned char before[kBlockBytes] = {};
    size_t unit_bytes = 1;
    bool holds_pointer = false;
  };

  std::string name_of(const void* pointer) const {
    if (pointer == nullptr) return "null";
    const auto given = std::find(given_, given_ + kMost, pointer);
    return given != given_ + kMost ? "#" + std::to_string(given - given_) : "a pointer";
  }

  template <class T>
  T* make_pointer(size_t at, bool input) {
    if constexpr (std::is_same_v<T, LXLocale>) {
      return visit_.locale;
    } else if constexpr (std::is_same_v<T, LXStream>) {
      return visit_.inside ? open_stream() : poison<T>(at);
    } else if constexpr (std::is_same_v<T, LXObject>) {
      return visit_.inside ? lx::globals.default_locale->codepage : poison<T>(at);
    } else if constexpr (std::is_same_v<T, LXCatalog> || std::is_same_v<T, LXFile> ||
                         std::is_same_v<T, LXConversion> || std::is_same_v<T, LXObjManager>) {
      return visit_.inside ? nullptr : poison<T>(at);
    } else {
      if (input && !visit_.ordinary) return poison<T>(at);
      Block& block = blocks_[at];
      if constexpr (!std::is_void_v<T>) block.unit_bytes = sizeof(T);
      if (!visit_.ordinary) memset(block.bytes, 0x5A, kBlockBytes);
      if constexpr (std::is_pointer_v<T>) {
        block.holds_pointer = true;
        void* const text = visit_.ordinary ? static_cast<void*>(empty_text_) : poison<void>();
        memcpy(block.bytes, &text, sizeof(text));
      }
      memcpy(block.before, block.bytes, kBlockBytes);
      return reinterpret_cast<T*>(block.bytes);
    }
  }

  /// A stream at the end of its input, which leaves no error in the locale.
  LXStream* open_stream() const {
    const auto transfer = [](void*, char*, int32_t) { return 0; };
    LXStream* stream = LXOpenStream(visit_.locale, transfer, nullptr, LX_STREAM_READ);
    lx::locale_of(visit_.locale)->last_error = kNothingStored;
    return stream;
  }

  const Visit visit_;
  Block blocks_[kMost];
  const void* given_[kMost] = {};
  char empty_text_[64] = {};
};

template <auto Function>
struct Caller;
template <class R, class... P, R (*Function)(P...)>
struct Caller<Function> {
  static std::string visit(const Visit& visit) { return call(visit, std::index_sequence_for<P...>()); }

  template <size_t... I>
  static std::string call(const Visit& visit, std::index_sequence<I...>) {
    Arguments arguments(visit);
    const std::tuple<P...> given{arguments.template make<P>(I, I + 1 == sizeof...(P))...};
    if constexpr (std::is_void_v<R>) {
      std::apply(Function, given);
      return "-" + arguments.written();
    } else {
      return arguments.outcome(std::apply(Function, given));
    }
  }
};

struct Door {
  std::string name;
  std::string (*visit)(const Visit&);
};
template <auto... Functions>
std::vector<Door> doors(const char* names) {
  std::vector<Door> all;
  std::istringstream list(names);
  for (auto* visit : {Caller<Functions>::visit...}) {
    std::string name;
    list >> name;
    if (name.back() == ',') name.pop_back();
    all.push_back({name, visit});
  }
  return all;
}
#define DOORS_(...) doors<__VA_ARGS__>(#__VA_ARGS__)
#define DOORS(...) DOORS_(__VA_ARGS__)
// The forms of a family: plain, of shift-sensitive text, of Unicode, of packed codes.
#define NARROW(f) f, f##Ex
#define WITH_U(f) NARROW(f), f##U
#define WITH_W(f) NARROW(f), f##W
#define ALL(f) WITH_U(f), f##W

/// Doors that answer alike.
struct Row {
  const char* outside;    // of the library
  const char* undefined;  // with an undefined flag, which gives error 2; empty: the last argument is no flags
  uint32_t defined;       // the flags that are not
  int32_t error;          // what an ordinary call stores in its locale; kNothingStored: it takes none
  std::vector<Door> doors;
};

std::vector<Row> rows() {
  constexpr int32_t kNone = kNothingStored;
  return {
      // Conversion, mapping, texts.
      {"-1", "-1", 0x4008, LX_OK,
       DOORS(WITH_W(LXConvertString), WITH_W(LXStringToUnicode), WITH_W(LXUnicodeToString))},
      {"-1", "-1", 0x4000, LX_OK,
       DOORS(NARROW(LXMbToWide), NARROW(LXWideToMb), WITH_U(LXStrxfrm), LXWcsxfrm, WITH_U(LXStrcat), LXWcscat,
             WITH_U(LXStrcpy), LXWcscpy, WITH_U(LXStrspn), LXWcsspn, WITH_U(LXStrcspn), LXWcscspn)},
      {"-1", "-1", 0x0008, LX_OK, DOORS(LXTerminateStringEx)},
      {"-1", "-1", 0x4010, LX_OK, DOORS(LXMapStringU)},
      {"-1", "-1", 0x0010, LX_E_INVALID, DOORS(WITH_W(LXMapString))},
      {"-1", "-1", 0x4001, LX_OK,
       DOORS(ALL(LXStringToTime), ALL(LXGetLocaleTextInfo), ALL(NLS1_GetLocaleTextInfo))},
      {"-1", "-1", 0x0001, LX_E_ITEM, DOORS(LXGetLocaleNumInfo, NLS1_GetLocaleNumInfo)},
      {"-1", "-1", 0x4009, LX_E_SIZE, DOORS(ALL(LXDoubleToString), ALL(LXTimeToString))},
      {"-1", "-1", 0x4049, LX_E_SIZE, DOORS(ALL(LXCurrencyToString))},
      {"-1", "-1", 0x4089, LX_E_SIZE, DOORS(ALL(LXLongToString))},
      {"-1", "-1", 0, LX_E_INVALID, DOORS(LXStrGenSortKey)},
      {"-2", "-2", 0xCF08, LX_OK, DOORS(ALL(LXReadString))},
      {"0", "0", 0x4000, LX_OK, DOORS(ALL(LXSetLocaleTextInfo), ALL(NLS1_SetLocaleTextInfo))},
      {"0", "0", 0x80204041, LX_OK, DOORS(WITH_U(LXStrcmp), NARROW(LXStrcoll))},
      {"0", "0", 0x80200041, LX_OK, DOORS(LXStrcollU)},
      {"0", "0", 0x00204000, LX_OK, DOORS(LXWcscmp)},
      {"0", "0", 0x0005, LX_E_NO_NATIVE, DOORS(LXConvertLocale)},
      {"11", "32", 0x0005, LX_E_NO_NATIVE, DOORS(NLS1_SetNativeFromLocale)},
      {"null", "null", 0x4000, LX_OK, DOORS(WITH_U(LXStrchr), LXWcschr)},
      {"null", "null", 0x80004041, LX_OK, DOORS(WITH_U(LXStrstr), LXWcsstr)},
      {"null", "null", 0x1F00, LX_OK, DOORS(ALL(LXPutEol))},
      {"null", "null", LX_CATALOG_LOAD, LX_E_INVALID, DOORS(LXOpenCatalog, LXOpenCatalogU, LXOpenCatalogW)},
      // Refused flags, and yet the outputs say where the text stands.
      {"0", "0, #3=#1", 0x40B1, LX_OK, DOORS(LXStringToLong, LXStringToLongU, LXStringToLongW)},
      {"0", "0, #4=#1", 0x40B1, LX_OK, DOORS(LXStringToLongEx)},
      {"0", "0, #3=#1", 0x4031, LX_OK, DOORS(LXStringToDouble, LXStringToDoubleU, LXStringToDoubleW)},
      {"0", "0, #4=#1", 0x4031, LX_OK, DOORS(LXStringToDoubleEx)},
      {"-1", "-1, #3=#1", 0x0010, LX_OK, DOORS(LXStrGetDigit, LXStrGetDigitU, LXStrGetDigitW)},
      {"-1", "-1, #4=#1", 0x0010, LX_OK, DOORS(LXStrGetDigitEx)},
      {"null", "null, #5=null", 0x4000, LX_OK, DOORS(LXStrtok, LXStrtokU, LXWcstok)},
      {"null", "null, #7=null", 0x4000, LX_OK, DOORS(LXStrtokEx)},
      {"null", "null, #3=2147483697, #4=0", 0x4F00, LX_OK, DOORS(ALL(LXGetEol))},
      // A mode, of which no bit stands alone; a sort, which the locale has not.
      {"null", "null", 0, LX_E_INVALID, DOORS(LXOpenStream)},
      {"0", "0", 0, LX_E_INVALID, DOORS(ALL(LXStrGetNextWeight))},
      // No flags, or flags of which none is undefined.
      {"0", "", 0, LX_OK,
       DOORS(LXWcscoll, NARROW(LXTruncateString), NARROW(LXGetChar), LXPutChar, NARROW(LXNumChars),
             WITH_W(LXByteLength), NARROW(LXValidChar), LXStrlenU, LXWcslen, ALL(LXUngetChar), LXFlushStream,
             LXCloseStream)},
      {"-1", "", 0, LX_OK, DOORS(LXStrGroupingSize, LXStrGroupingSizeU, LXStrGroupingSizeW)},
      {"0", "", 0, LX_E_STREAM_DIRECTION, DOORS(ALL(LXWriteChar))},
      {"0", "", 0, LX_E_INVALID, DOORS(ALL(LXGetCharType))},
      {"0", "", 0, LX_E_ITEM, DOORS(LXSetLocaleNumInfo, NLS1_SetLocaleNumInfo)},
      {"1", "", 0, LX_OK, DOORS(LXConversionRatio)},
      {"null", "", 0, LX_OK, DOORS(LXOpenConversion)},
      {"11", "", 0, LX_OK, DOORS(LXLocaleSetModifiable, LXLocaleChangeCodePage)},
      {"11", "", 0, LX_E_NOT_FOUND, DOORS(LXLocaleChangeTerritory)},
      {"65535", "", 0, LX_E_STREAM_COUNT, DOORS(LXReadCharU)},
      {"4294967294", "", 0, LX_OK, DOORS(LXReadCharW)},
      {"#1", "", 0, LX_OK, DOORS(LXNextChar, NARROW(LXMoveStringPointer))},
      {"#1, #3=10", "", 0, LX_OK, DOORS(LXNextCharEx)},
      {"#2", "", 0, LX_OK, DOORS(LXPrevChar)},
      {"#2, #4=10", "", 0, LX_OK, DOORS(LXPrevCharEx)},
      {"-", "", 0, LX_OK, DOORS(LXPutCharEx, LXMapNativeInfo)},
      {"-, #1=0", "", 0, LX_OK, DOORS(LXInitState)},
      // The locale itself, and values that come back where there is none.
      {"1", "", 0, kNone, DOORS(LXReleaseLocale)},
      {"11", "", 0, kNone, DOORS(LXGetError)},
      {"0", "", 0, LX_OK, DOORS(LXUnicodeToLower, LXUnicodeToUpper, LXUnicodeToF2H, LXUnicodeToH2F)},
      // No locale: creation and objects.
      {"null, #2=11", "", 0, kNone,
       DOORS(LXGetLocale, LXGetLocaleU, LXGetLocaleW, LXInitObjManager, NLS1_ConvertNativeLocale)},
      {"null, #2=2", "", 0, kNone, DOORS(LXConvertNativeLocale)},
      {"null, #3=1", "", 0, kNone, DOORS(NLS1_GetLocale)},
      {"null, #3=11", "", 0, kNone, DOORS(LXLoadFile)},
      {"null, #4=null", "", 0, kNone, DOORS(LXCpV1toV2)},
      {"null, #4=11", "", 0, kNone, DOORS(LXOpenFile, LXGetObjFromID)},
      {"null, #5=11", "", 0, kNone, DOORS(LXGetObjFromName, LXGetObjFromNameW)},
      {"null", "", 0, kNone,
       DOORS(LXGetCodepageFromAlias, LXGetDataFileName, LXGetMbCtype, LXGetMbCtypeW, LXMcMalloc, LXMcRealloc,
             NLS1_PrivateFunction_GetThreadLocale)},
      {"11", "", 0, kNone,
       DOORS(LXSetLocale, LXSetLocaleU, LXSetLocaleW, LXEnumAliases, LXConvertBuffer, LXCloseConversion,
             LXGetMessage, LXGetMessageU, LXGetMessageW, LXCloseCatalog, NLS1_SetLocale,
             NLS1_SetLocaleFromNative, NLS1_SetNativeLocale, NLS1_GetCodepageName, NLS1_GetLanguageName,
             NLS1_GetSortName, NLS1_GetTerritoryName)},
      {"0, #1=11", "", 0, kNone,
       DOORS(NLS1_GetCodepageId, NLS1_GetLanguageId, NLS1_GetSortId, NLS1_GetTerritoryId)},
      {"-1, #6=0, #8=11", "", 0, kNone, DOORS(NLS1_TranslateString)},
      {"-1, #2=0", "", 0, kNone, DOORS(LXComStrToUnicode, LXComUnicodeToStr)},
      {"-1", "", 0, kNone, DOORS(LXCpStrToUnicode, LXStrDoubleNextState, LXGetDataLocation)},
      {"0", "", 0, kNone,
       DOORS(LXEnumLocales, LXEnumLocalesU, LXEnumLocalesW, LXGetUserLocale, LXLangGetSpecial,
             LXSortGetCombination, LXSortGetWeights, LXCpFullToHalfW, LXCpMbHalfToFullW, LXCpMbCaseConv,
             LXCpMbCaseConvS, LXCpStrByteToCharLen, LXCpStrCharToByteLen, LXCpUnicodeToChar, LXCpUnicodeToCharW,
             LXCpUnicodeToStr, LXMbToW, LXMbToWS, LXMcFree, LXUnloadFile)},
      {"10", "", 0, kNone, DOORS(LXCpMbCaseConvW)},
      {"65533", "", 0, kNone, DOORS(LXCpMbToUnicode, LXCpMbToUnicodeW)},
      {"2", "", 0, kNone, DOORS(LXCloseFile, LXTermObjManager)},
      {"-", "", 0, kNone, DOORS(NLS1_PrivateFunction_GetProcessLocale)},
      {"11", "", 0, kNone, DOORS(LXTerm)},
  };
}

/// Doors that need no library.
std::vector<Door> free_doors() {
  return DOORS(LXEnumNativeLocales, LXGetEnv, LXGetControlFileName, LXMapNativeLocale, LXMcGetByteOrder,
               LXMcMemcpy, LXMcSetZero, LXStrBigEndian, LXStrByteLength, LXStrInsertWeights, LXWToMb, LXmemicmp,
               MakePath, SplitDir, SplitDrive, SplitExtent, SplitFile, SplitPath, LXDefAlloc, LXDefFree,
               LXFileSize, LXReadFile, LXSeekFile, LXInit);
}

class DoorsTest : public LibraryTest {
 protected:
  /// Every door says what it says without a library, and reads nothing. With `only_locale` the doors that take
  /// a locale, when none is given.
  static void expect_outside(const char* when, bool only_locale = false) {
    expect_in_child(when, [=] {
      init_failure = LX_E_NOT_INITIALIZED;
      for (const Row& row : rows()) {
        if (only_locale && row.error == kNothingStored) continue;
        for (const Door& door : row.doors) {
          EXPECT_EQ(door.visit({nullptr, false, false}), row.outside) << door.name;
          LXLocale* const given = only_locale ? nullptr : poison<LXLocale>();
          EXPECT_EQ(door.visit({given, false, false}), row.outside) << door.name;
        }
      }
    });
  }

  /// Each door with no locale and with one: the same outcome, and `error` stored where it belongs.
  static void expect_inside(const Door& door, bool ordinary, uint32_t flags, int32_t error,
                            const std::string& outcome) {
    LXLocale* const other = LXGetLocale("", 0, nullptr);
    LXLocale* const common = lx::globals.default_locale;
    for (LXLocale* given : {static_cast<LXLocale*>(nullptr), other}) {
      common->last_error = other->last_error = kNothingStored;
      EXPECT_EQ(door.visit({given, true, ordinary, flags}), outcome) << door.name;
      EXPECT_EQ((given != nullptr ? given : common)->last_error, error) << door.name;
      EXPECT_EQ((given != nullptr ? common : other)->last_error, kNothingStored) << door.name;
    }
    LXReleaseLocale(other);
  }
};

TEST_F(DoorsTest, TheTableNamesEveryExportOnce) {
  std::ifstream file(LEXICOR_DATA_DIR "/../cmake/exports.txt");
  const std::set<std::string> exports{std::istream_iterator<std::string>(file), {}};
  std::set<std::string> named;
  std::vector<Door> all = free_doors();
  for (const Row& row : rows()) all.insert(all.end(), row.doors.begin(), row.doors.end());
  for (const Door& door : all) EXPECT_TRUE(named.insert(door.name).second) << door.name << " twice";
  EXPECT_EQ(named, exports);
}

TEST_F(DoorsTest, OutsideTheLibrary) {
  setenv("LX_LANG", "English", 1);
  expect_outside("before LXInit");
  hooks.fail_at(1);
  ASSERT_EQ(init_with_locale(), LX_E_MEMORY);
  expect_outside("after LXInit found no memory for the area");
  EXPECT_EQ(LXTerm(), LX_E_NOT_INITIALIZED);
  hooks.fail_at(2);
  ASSERT_EQ(init(), LX_E_NOT_INITIALIZED);
  expect_outside("while the area of a failed call is left");
  hooks.fail_at(0);
  ASSERT_EQ(init(), LX_OK);
  expect_outside("without a default locale", true);
  ASSERT_EQ(LXSetLocale("", 0), LX_OK);
  ASSERT_EQ(LXTerm(), LX_OK);
  expect_outside("after the last LXTerm");
}

// The services' forms do what the functions do whose names they have, within events of their own unit.
TEST_F(DoorsTest, ServicesForward) {
  expect_in_child("services", [] {
    NLS1_PrivateFunction_GetProcessLocale();
    std::map<std::string, Door> all;
    for (const Row& row : rows())
      for (const Door& door : row.doors) all[door.name] = door;
    size_t pairs = 0;
    for (const auto& [name, service] : all) {
      const auto core = all.find("LX" + name.substr(std::min(name.size(), strlen("NLS1_"))));
      if (name.rfind("NLS1_", 0) != 0 || name.find("Locale") == name.size() - 6 || core == all.end()) continue;
      ++pairs;
      for (int32_t number : {0, 1, 10, 63, 64}) {  // items, sizes and lengths, of texts that are empty
        LXLocale* const locales[] = {LXGetLocale("", 0, nullptr), LXGetLocale("", 0, nullptr)};
        const std::string expected = core->second.visit({locales[0], true, true, 0, number});
        RecordingTrace::take();
        RecordingTrace::set_level(RAS1_LEVEL_EVENTS);
        EXPECT_EQ(service.visit({locales[1], true, true, 0, number}), expected) << name << ' ' << number;
        RecordingTrace::set_level(0);
        const std::vector<TraceRecord> records = RecordingTrace::take();
        EXPECT_EQ(records.front().unit + records.back().unit, "qrlnls1qrlnls1") << name;
        EXPECT_EQ(records.back().kind, TraceRecord::kExitValue);
        EXPECT_EQ(LXGetError(locales[1]), LXGetError(locales[0])) << name;
        EXPECT_EQ(locales[1]->changed, locales[0]->changed) << name;
        for (LXLocale* locale : locales) LXReleaseLocale(locale);
      }
    }
    EXPECT_EQ(pairs, 10u);
  });
}

TEST_F(DoorsTest, UndefinedFlagsAndNoLocale) {
  expect_in_child("inside", [] {
    NLS1_PrivateFunction_GetProcessLocale();
    ASSERT_NE(lx::globals.default_locale, nullptr);
    for (const Row& row : rows()) {
      for (const Door& door : row.doors) {
        for (uint32_t flag = 1; *row.undefined != '\0' && flag != 0; flag <<= 1) {
          if ((row.defined & flag) == 0) {
            expect_inside(door, false, flag, LX_E_INVALID, row.undefined);
          } else if (row.error != LX_E_INVALID) {
            door.visit({nullptr, true, true, flag});
            EXPECT_NE(LXGetError(nullptr), LX_E_INVALID) << door.name << ' ' << flag;
          }
        }
        if (row.error == kNothingStored) continue;
        const std::string with_default = door.visit({lx::globals.default_locale, true, true});
        expect_inside(door, true, 0, row.error, with_default);
      }
    }
  });
}

}  // namespace
}  // namespace lx::test
