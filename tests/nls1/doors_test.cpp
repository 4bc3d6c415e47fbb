// Every exported function as a door: what it answers, and what it writes, without the library, with undefined
// flags, and where no locale is given, as doors.txt says; and the events of each call.
#include <fstream>
#include <set>
#include <sstream>

#include "core/library_fixture.h"
#include "nls1.h"
#include "support/case_rows.h"

namespace lx::test {
extern int32_t init_failure;  // of LXInit; nls1_test.cpp
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
    if constexpr (std::is_void_v<R>) {
      Function(arguments.template make<P>(I, I + 1 == sizeof...(P))...);
      return "-" + arguments.written();
    } else {
      return arguments.outcome(Function(arguments.template make<P>(I, I + 1 == sizeof...(P))...));
    }
  }
};

using Door = std::string (*)(const Visit&);

/// Every exported function by its name.
template <Door... All>
std::map<std::string, Door> by_name() {
  std::ifstream names(LEXICOR_DATA_DIR "/../cmake/exports.txt");
  std::map<std::string, Door> doors;
  std::string name;
  for (const Door door : {All...}) names >> name, doors[name] = door;
  EXPECT_FALSE(names >> name);
  return doors;
}
const std::map<std::string, Door>& exported() {
#define DOOR(function) Caller<function>::visit
  static const auto all = by_name<
#include "exported_doors.inc"
      >();
  return all;
}

/// A line of doors.txt.
struct Row {
  bool needs_library, has_flags, has_locale;
  uint32_t flags;
  int32_t error;
  std::string outside, undefined;
  std::vector<std::string> names;
};
std::vector<Row> rows() {
  std::vector<Row> all;
  for (const CaseRow& row : case_rows("nls1/doors.txt")) {
    const bool alone = row.fields.size() == 1;
    Row made{!alone, !alone && row[0] != "-", !alone && row[1] != "-", 0, 0, "", "", {}};
    if (made.has_flags) made.flags = static_cast<uint32_t>(row.number(0));
    if (made.has_locale) made.error = row.number(1);
    if (!alone) made.outside = row[2], made.undefined = row[3];
    std::istringstream names(row.fields.back());
    for (std::string name; names >> name;) {
      std::istringstream parts(name);
      std::string base, form;
      std::getline(parts, base, '/');
      if (parts.eof()) made.names.push_back(base);
      while (std::getline(parts, form, '/')) made.names.push_back(base + form);
    }
    all.push_back(made);
  }
  return all;
}

class DoorsTest : public LibraryTest {
 protected:
  /// Calls a door. Each entry has its exit, the last one with the result; without the trace nothing is said.
  static std::string call(const std::string& name, const Visit& visit) {
    EXPECT_TRUE(RecordingTrace::take().empty()) << "before " << name;
    RecordingTrace::set_level(RAS1_LEVEL_EVENTS);
    const std::string outcome = exported().at(name)(visit);
    RecordingTrace::set_level(0);
    const std::vector<TraceRecord> records = RecordingTrace::take();
    int depth = 0;
    for (const TraceRecord& record : records) {
      EXPECT_NE(record.kind, TraceRecord::kMessage) << name << ": " << record.text;
      EXPECT_FALSE(record.unit.empty()) << name;
      EXPECT_GT(record.line, 0) << name;
      depth += record.kind == TraceRecord::kEntry ? 1 : -1;
      EXPECT_GE(depth, 0) << name;
    }
    EXPECT_EQ(depth, 0) << name;
    char* end = nullptr;
    const auto number = static_cast<int32_t>(std::strtoll(outcome.c_str(), &end, 10));
    const bool has_own = name.rfind("LXCom", 0) != 0;  // in those two the common codepage is looked up
    if (end != outcome.c_str() && !records.empty() && has_own) {
      EXPECT_EQ(records.back().kind, TraceRecord::kExitValue) << name;
      EXPECT_EQ(static_cast<int32_t>(records.back().value), number) << name;
    }
    return outcome;
  }

  /// Every door says what it says without a library, and reads nothing. With `only_locale` the doors that take
  /// a locale, when none is given.
  static void expect_outside(const char* when, bool only_locale = false) {
    expect_in_child(when, _exit, [=] {
      init_failure = LX_E_NOT_INITIALIZED;
      for (const Row& row : rows())
        for (const std::string& name : row.names) {
          if (!row.needs_library || (only_locale && !row.has_locale)) continue;
          for (LXLocale* given : {static_cast<LXLocale*>(nullptr), only_locale ? nullptr : poison<LXLocale>()})
            EXPECT_EQ(call(name, {given, false, false}), row.outside) << name;
        }
    });
  }

  /// Each door with no locale and with one: the same outcome, and `error` stored where it belongs.
  static void expect_inside(const std::string& name, bool ordinary, uint32_t flags, int32_t error,
                            const std::string& outcome) {
    LXLocale* const other = LXGetLocale("", 0, nullptr);
    LXLocale* const common = lx::globals.default_locale;
    for (LXLocale* given : {static_cast<LXLocale*>(nullptr), other}) {
      common->last_error = other->last_error = kNothingStored;
      EXPECT_EQ(call(name, {given, true, ordinary, flags}), outcome) << name;
      EXPECT_EQ((given != nullptr ? given : common)->last_error, error) << name;
      EXPECT_EQ((given != nullptr ? common : other)->last_error, kNothingStored) << name;
    }
    LXReleaseLocale(other);
  }
};

TEST_F(DoorsTest, TheTableNamesEveryExportOnce) {
  std::set<std::string> named;
  for (const Row& row : rows())
    for (const std::string& name : row.names) EXPECT_TRUE(named.insert(name).second) << name << " twice";
  for (const auto& [name, door] : exported()) EXPECT_EQ(named.erase(name), 1u) << name;
  EXPECT_EQ(named, std::set<std::string>()) << "not exported";
}

TEST_F(DoorsTest, OutsideTheLibrary) {
  setenv("LX_LANG", "English", 1);
  expect_outside("before LXInit");
  directory.write_locale({{367, "US-ASCII", ascii_codepage()}});
  hooks.fail_at(1);
  ASSERT_EQ(init(), LX_E_MEMORY);
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
  expect_in_child("services", _exit, [] {
    NLS1_PrivateFunction_GetProcessLocale();
    size_t pairs = 0;
    for (const auto& [name, service] : exported()) {
      const auto core = exported().find("LX" + name.substr(std::min(name.size(), strlen("NLS1_"))));
      if (name.rfind("NLS1_", 0) != 0 || name.find("Locale") == name.size() - 6 || core == exported().end())
        continue;
      ++pairs;
      for (int32_t number : {0, 1, 10, 63, 64}) {  // items, sizes and lengths, of texts that are empty
        LXLocale* const locales[] = {LXGetLocale("", 0, nullptr), LXGetLocale("", 0, nullptr)};
        const std::string expected = core->second({locales[0], true, true, 0, number});
        RecordingTrace::take();
        RecordingTrace::set_level(RAS1_LEVEL_EVENTS);
        EXPECT_EQ(service({locales[1], true, true, 0, number}), expected) << name << ' ' << number;
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
  expect_in_child("inside", _exit, [] {
    NLS1_PrivateFunction_GetProcessLocale();
    ASSERT_NE(lx::globals.default_locale, nullptr);
    for (const Row& row : rows())
      for (const std::string& name : row.names) {
        const Door door = exported().at(name);
        for (uint32_t flag = 1; row.has_flags && flag != 0; flag <<= 1) {
          if ((row.flags & flag) == 0) {
            expect_inside(name, false, flag, LX_E_INVALID, row.undefined);
          } else if (row.error != LX_E_INVALID) {
            door({nullptr, true, true, flag});
            EXPECT_NE(LXGetError(nullptr), LX_E_INVALID) << name << ' ' << flag;
          }
        }
        if (row.has_locale)
          expect_inside(name, true, 0, row.error, door({lx::globals.default_locale, true, true}));
      }
  });
}

}  // namespace
}  // namespace lx::test
