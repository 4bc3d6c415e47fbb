// The object manager: where the control file is searched, look-ups by name, identifier and alias, loading, and
// the built-in data that stand in.
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <cstring>
#include <filesystem>
#include <thread>

#include "codepage/lxcodepage.h"
#include "core/tiny_directory.h"
#include "support/case_rows.h"
#include "support/forms.h"

namespace lx::test {
namespace {

class ObjManTest : public LibraryTest {
 protected:
  static LXObject* by_id(int32_t type, uint16_t id, int32_t mode = LX_FIND_AND_LOAD) {
    return LXGetObjFromID(nullptr, type, id, mode, &rc);
  }
  static inline int32_t rc;
};

// A control file that opens ends the search, whatever it holds.
TEST_F(ObjManTest, SearchOrder) {
  if (access(kDefaultControl, F_OK) == 0) GTEST_SKIP();
  ScratchDirectory environment, bad_magic, before_start;
  ByteString file = control_file({{1, LX_LANGUAGE, "Given"}});
  directory.write("control.nls", file);
  put_le32(file.data() + format::header_section_offset(0), 0x80000000);
  before_start.write("control.nls", file);
  file[0] ^= 1;
  bad_magic.write("control.nls", file);
  environment.write("control.nls", control_file({{1, LX_LANGUAGE, "Environment"}}));
  const std::string given = directory.path(), env = environment.path(), none = directory.file("none"), unset,
                    bad = bad_magic.path(), before = before_start.path();
  // A control-file name takes 13 bytes beside the directory, in 256.
  const std::string longest(243, 'x'), too_long(244, 'x'), over_buffer(256, 'x');
  const std::string not_made = "Unable to construct control file name in directory " + too_long +
                               "\ncontrol size = 256\n",
                    not_opened = "Unable to open " + none + "/control.nls, err = 1000\n";
  const struct {
    const char* what;
    const std::string &given, &env;
    int32_t code;
    const char* language;
    std::vector<std::string> opened;  // directories
    std::string said = "";            // among the errors
  } cases[] = {
      {"the directory given", given, env, LX_OK, "Given", {given}},
      {"none given", unset, env, LX_OK, "Environment", {env}},
      {"the longest name goes on", longest, env, LX_OK, "Environment", {longest, env}},
      {"a longer one ends the search", too_long, env, LX_E_FILE_IO, "English", {}, not_made},
      {"nothing at all", unset, unset, LX_E_FILE_NOT_FOUND, "English", {"/Tessarin/locale"}},
      {"a variable whose control file's name does not fit", unset, too_long, LX_E_FILE_IO, "English", {}},
      {"a variable that does not fit", none, over_buffer, LX_E_FILE_IO, "English", {none}, not_opened},
      {"wrong magic number", bad, env, LX_E_CORRUPT, "English", {bad}},
      {"a table before the start", before, env, LX_E_FILE_IO, "English", {before}},
  };
  for (const auto& c : cases) {
    SCOPED_TRACE(c.what);
    c.env.empty() ? unsetenv("LX_LOCALEDIR") : setenv("LX_LOCALEDIR", c.env.c_str(), 1);
    const char* const path = c.given.empty() ? nullptr : c.given.c_str();
    std::vector<std::string> paths =
        opened([&] { EXPECT_EQ(init(path), c.code == LX_OK ? LX_OK : LX_W_DEFAULTS); });
    if (!paths.empty() && paths.back().find("/alias.txt") != std::string::npos) paths.pop_back();
    std::vector<std::string> expected;
    for (const std::string& name : c.opened) expected.push_back(name + "/control.nls");
    EXPECT_EQ(paths, expected);
    EXPECT_STREQ(by_id(LX_LANGUAGE, 1, LX_FIND_ONLY)->disk.name, c.language);
    LXObjManager* own = nullptr;
    std::string said;
    for (const auto& text : messages(RAS1_LEVEL_ERRORS, [&] { own = LXInitObjManager(path, 0, &rc); }))
      said += text + "\n";
    EXPECT_NE(said.find(c.said), std::string::npos) << said;
    EXPECT_EQ(rc, c.code);
    ASSERT_NE(own, nullptr);
    EXPECT_EQ(LXTermObjManager(own), LX_OK);
    EXPECT_EQ(LXTerm(), LX_OK);
  }
}

/// A control file whose table stands somewhere in it. Bytes behind the last whole record do not count.
ByteString moved_table(const std::vector<ControlRecord>& records) {
  constexpr size_t kGapBytes = 1000;
  const size_t rest_bytes = records.empty() ? 0 : format::kRecordBytes - 1;
  ByteString file = control_file(records);
  const size_t table_bytes = file.size() - format::kHeaderBytes;
  file.insert(file.begin() + format::kHeaderBytes, kGapBytes, 0xA5);
  file.resize(file.size() + rest_bytes);
  put_le32(file.data() + format::header_section_offset(0), format::kHeaderBytes + kGapBytes);
  put_le16(file.data() + format::header_section_size(0), static_cast<uint16_t>(table_bytes + rest_bytes));
  return file;
}

TEST_F(ObjManTest, LookUps) {
  std::vector<ControlRecord> table;
  for (const CaseRow& row : case_rows("core/look_ups.txt")) {
    SCOPED_TRACE(row.where);
    if (row[0] == "table") table.clear();
    if (row[0] == "entry")
      table.push_back({static_cast<uint16_t>(row.number(2)), static_cast<uint8_t>(row.number(1)), row[3]});
    if (row.fields.size() < 5) {
      terminate();
      directory.write("control.nls", moved_table(table));
      ASSERT_EQ(init(), LX_OK);
      continue;
    }
    const int32_t type = row.number(1), number = row.number(2);
    const std::string& name = row[3];
    const auto expect = [&](const LXObject* found) {
      const std::string shown = found != nullptr ? std::to_string(found->disk.id) + " " + found->disk.name : "";
      EXPECT_EQ(found != nullptr ? shown : rc == LX_OK ? "nothing" : "none", row[4]);
      EXPECT_EQ(rc, row[4] == "none" ? LX_E_NOT_FOUND : LX_OK);
    };
    if (row[0] == "id") {
      expect(by_id(type, static_cast<uint16_t>(number), LX_FIND_ONLY));
    } else {
      expect(LXGetObjFromName(nullptr, type, name.c_str(), number, LX_FIND_ONLY, &rc));
      const auto wide = widened<LXWChar>(name + std::string(1, '\0'));
      expect(LXGetObjFromNameW(nullptr, type, wide.c_str(), number, LX_FIND_ONLY, &rc));
    }
  }
  const LXWChar beyond[] = {'O' + 0x100, 'd', 'd', 0};
  EXPECT_EQ(LXGetObjFromNameW(nullptr, LX_TERRITORY, beyond, 3, LX_FIND_ONLY, &rc), nullptr);
}

// A multibyte codepage needs its first three sections; a count above four counts four.
TEST_F(ObjManTest, LoadsAsManySectionsAsCounted) {
  std::vector<ByteString> sections = tiny_shift_jis().file.sections;
  sections[3] = {1, 2, 3};
  ByteString file = object_file(sections);
  directory.write_locale({{850, "Tiny", sections}});
  for (uint16_t counted : {uint16_t{2}, uint16_t{3}, uint16_t{4}, uint16_t{0xFFFF}}) {
    SCOPED_TRACE(counted);
    put_le16(file.data() + format::kHeaderSections, counted);
    directory.write("cp_00850.nls", file);
    ASSERT_EQ(init(), LX_OK);
    const LXObject* const found = by_id(LX_CODEPAGE, 850);
    ASSERT_NE(found, nullptr);
    EXPECT_EQ(rc, counted < 3 ? LX_E_CORRUPT : LX_OK);
    EXPECT_EQ(found->section[3] != nullptr, counted > 3);
    EXPECT_EQ(LXTerm(), LX_OK);
  }
}

// Built-in data stand in, and the code is kept.
TEST_F(ObjManTest, LoadsThatFail) {
  const struct {
    int32_t type;
    uint16_t id;
    const char* file;
    const BuiltIn* built_in;
  } objects[] = {{LX_LANGUAGE, 1, "la_00001.nls", &kBuiltInLanguage},
                 {LX_TERRITORY, 840, "te_00840.nls", &kBuiltInTerritory},
                 {LX_CODEPAGE, tiny_shift_jis().file.id, "cp_09002.nls", &kBuiltInCodepage},
                 {LX_SORT, kSortId, "so_00005.nls", nullptr}};
  const struct {
    int32_t code;
    std::function<void(const std::string&, ByteString*)> damage;  // the content, or what stands in its place
  } damages[] = {
      {LX_E_FILE_NOT_FOUND, nullptr},
      {LX_E_CORRUPT, [](auto&, ByteString* file) { (*file)[3] ^= 0x80; }},
      {LX_E_FILE_IO, [](auto&, ByteString* file) { file->pop_back(); }},
      {LX_E_CORRUPT,
       [](auto&, ByteString* file) { put_le16(file->data() + format::header_section_size(0), 0); }},
      {LX_E_FILE_IO,
       [](auto&, ByteString* file) { put_le32(file->data() + format::header_section_offset(0), 0xFFFFFFFF); }},
      {LX_E_FILE_IO,
       [](auto& path, ByteString* file) { std::filesystem::create_directory(path), file->clear(); }},
      {LX_E_OPEN, [](auto& path, ByteString* file) { mkfifo(path.c_str(), 0600), file->clear(); }},
  };
  write_tiny_directory(directory);
  const int descriptor = dup(0);
  ASSERT_GE(descriptor, 0);
  close(descriptor);
  for (const auto& object : objects)
    for (const auto& damage : damages)
      for (const uint32_t options : {0u, uint32_t{LX_NO_DEFAULTS}}) {
        SCOPED_TRACE(std::string(object.file) + ", damage " + std::to_string(&damage - damages));
        const bool stands_in = options == 0 && object.built_in != nullptr;
        const ByteString sound = directory.read(object.file);
        ByteString content = sound;
        std::filesystem::remove(directory.file(object.file));
        if (damage.damage != nullptr) damage.damage(directory.file(object.file), &content);
        if (damage.damage != nullptr && !content.empty()) directory.write(object.file, content);
        ASSERT_EQ(init(directory.path().c_str(), options), LX_OK);
        const LXObject* entry = by_id(object.type, object.id, LX_FIND_ONLY);
        ASSERT_NE(entry, nullptr);
        EXPECT_EQ(by_id(object.type, object.id), stands_in ? entry : nullptr);
        EXPECT_EQ(rc, damage.code);
        EXPECT_EQ(entry->file, nullptr);
        EXPECT_EQ(entry->disk.id, object.id);
        EXPECT_EQ(entry->disk.flags, stands_in ? kObjectBuiltIn : 0);
        for (size_t i = 0; i < format::kMaxSections; ++i)
          EXPECT_EQ(entry->section[i], stands_in ? object.built_in->sections.section[i].data : nullptr);
        EXPECT_EQ(by_id(object.type, object.id), stands_in ? entry : nullptr) << "it is loaded, or tried again";
        EXPECT_EQ(rc, stands_in ? LX_OK : damage.code);
        for (const int32_t flags : {0, int32_t{LX_FALLBACK}}) {
          LXLocale* locale = LXGetLocale("English_UnitedStates.TINY-SJIS@Default", flags, &rc);
          EXPECT_EQ(rc, stands_in ? LX_OK : LX_E_NOT_INITIALIZED) << "not that something is not there";
          LXReleaseLocale(locale);
        }
        std::filesystem::remove(directory.file(object.file));
        directory.write(object.file, sound);
        EXPECT_EQ(by_id(object.type, object.id), entry) << "mended on disk";
        EXPECT_EQ(rc, LX_OK);
        EXPECT_EQ(LXTerm(), LX_OK);
        EXPECT_EQ(hooks.live_blocks(), 0u);
      }
  EXPECT_EQ(dup(0), descriptor) << "no file is left open";
  close(descriptor);
}

TEST_F(ObjManTest, ManyThreadsLoadAnObjectOnce) {
  directory.write_locale({{850, "Tiny", tiny_shift_jis().file.sections}});
  constexpr int kThreads = 8;
  for (int round = 0; round < 20; ++round) {
    ASSERT_EQ(init(), LX_OK);
    std::atomic<int> waiting{kThreads}, loaded{0};
    const std::vector<std::string> paths = opened([&] {
      std::vector<std::thread> threads;
      for (int i = 0; i < kThreads; ++i)
        threads.emplace_back([&, i] {
          --waiting;
          while (waiting != 0) std::this_thread::yield();
          int32_t code = -1;
          const LXObject* found = i % 2 == 0 ? LXGetObjFromID(nullptr, LX_CODEPAGE, 850, 0, &code)
                                             : LXGetObjFromName(nullptr, LX_CODEPAGE, "Tiny", 4, 0, &code);
          if (code == LX_OK && LXMbToW(found, "\x82\x42") == 0x8242) ++loaded;
        });
      for (std::thread& thread : threads) thread.join();
    });
    EXPECT_EQ(paths.size(), 1u);
    EXPECT_EQ(loaded, kThreads);
    EXPECT_EQ(LXTerm(), LX_OK);
  }
}

// What alias files hold and how an alias is found stands in tests/cases/cli/aliases.txt.
// What is loaded stays, whatever becomes of its file; what is loaded later comes from the file that is there then.
TEST_F(ObjManTest, FilesThatChangeUnderARunningProgram) {
  write_tiny_directory(directory);
  ASSERT_EQ(init(directory.path().c_str(), LX_NO_DEFAULTS), LX_OK);
  LXLocale* const locale = LXGetLocale("English_UnitedStates.TINY-SJIS@Default", 0, &rc);
  ASSERT_NE(locale, nullptr);
  const std::string before = state_of(locale);
  for (const auto& entry : std::filesystem::directory_iterator(directory.path())) {
    const std::string name = entry.path().filename().string();
    ByteString content = directory.read(name);
    if (name == "cp_09003.nls") continue;  // replaced as a whole, by a rename
    std::fill(content.begin() + std::min<ptrdiff_t>(4, count_of(content)), content.end(), 0xFF);
    directory.write(name, content);  // in place
  }
  directory.write("fresh", object_file(tiny_single().file.sections));
  std::filesystem::rename(directory.file("fresh"), directory.file("cp_09003.nls"));
  EXPECT_EQ(state_of(locale), before);
  LXLocale* const again = LXGetLocale("English_UnitedStates.TINY-SJIS@Default", 0, &rc);
  ASSERT_NE(again, nullptr);
  EXPECT_EQ(state_of(again), before);
  EXPECT_EQ(by_id(LX_CODEPAGE, 9004), nullptr);
  EXPECT_EQ(rc, LX_E_FILE_IO);
  const LXObject* const replaced = by_id(LX_CODEPAGE, 9003);
  ASSERT_NE(replaced, nullptr);
  EXPECT_EQ(codepage_of(*replaced).width, 1);
  std::filesystem::rename(directory.path(), directory.path() + ".away");
  EXPECT_EQ(by_id(LX_CODEPAGE, 9005), nullptr);
  EXPECT_EQ(rc, LX_E_FILE_NOT_FOUND);
  EXPECT_EQ(state_of(locale), before);
  std::filesystem::rename(directory.path() + ".away", directory.path());
  EXPECT_EQ(LXReleaseLocale(again), LX_OK);
  EXPECT_EQ(LXReleaseLocale(locale), LX_OK);
}

TEST_F(ObjManTest, EachManagerHasItsOwn) {
  ScratchDirectory other;
  other.write("control.nls", control_file({{1, LX_LANGUAGE, "Other"}}));
  other.write_text("alias.txt", "B one\n");
  directory.write("control.nls", control_file({{1, LX_LANGUAGE, "English"}}));
  directory.write_text("alias.txt", "A one two\n");
  ASSERT_EQ(init(), LX_OK);
  LXObjManager* own = LXInitObjManager(other.path().c_str(), 0, &rc);
  EXPECT_EQ(rc, LX_OK);
  ASSERT_NE(own, nullptr);
  EXPECT_STREQ(LXGetCodepageFromAlias(own, "ONE"), "B");
  EXPECT_STREQ(LXGetCodepageFromAlias(nullptr, "ONE"), "A");
  EXPECT_STREQ(LXGetObjFromID(own, LX_LANGUAGE, 1, LX_FIND_ONLY, &rc)->disk.name, "Other");
  EXPECT_STREQ(LXGetObjFromID(nullptr, LX_LANGUAGE, 1, LX_FIND_ONLY, &rc)->disk.name, "English");
  int calls = 0;
  const auto stop = [](void* user, const char*, const char*) { return ++*static_cast<int*>(user), 0; };
  EXPECT_EQ(LXEnumAliases(nullptr, stop, &calls), LX_OK);
  EXPECT_EQ(calls, 1);
  EXPECT_EQ(LXTermObjManager(own), LX_OK);
  EXPECT_EQ(LXTermObjManager(nullptr), LX_E_INVALID);
}

TEST_F(ObjManTest, FileAndDirectoryNames) {
  char buffer[32];
  EXPECT_EQ(LXGetControlFileName("/d", buffer, 15), buffer);
  EXPECT_STREQ(buffer, "/d/control.nls");
  strcpy(buffer, "#");
  EXPECT_EQ(LXGetControlFileName("/d", buffer, 14), nullptr);
  EXPECT_STREQ(buffer, "#");

  ASSERT_EQ(init(), LX_W_DEFAULTS);
  EXPECT_EQ(LXGetDataFileName("/d", LX_SORT, 1, buffer, 16), buffer);
  EXPECT_STREQ(buffer, "/d/so_00001.nls");
  ::testing::internal::CaptureStderr();
  EXPECT_EQ(LXGetDataFileName("/d", LX_SORT, 1, buffer, 15), nullptr);
  EXPECT_EQ(::testing::internal::GetCapturedStderr(), "Buffer provided = 15, needed = 16\n");
  for (const int32_t type : {4, -1}) EXPECT_EQ(LXGetDataFileName("/d", type, 1, buffer, 32), nullptr);
  strcpy(buffer, "#");
  EXPECT_EQ(LXGetDataLocation(buffer, sizeof(buffer), 0), -1);
  setenv("LX_LOCALEDIR", "/some/where", 1);
  for (const int32_t size : {-1, 11}) EXPECT_EQ(LXGetDataLocation(buffer, size, 0), 0);
  EXPECT_EQ(LXGetDataLocation(buffer, 16, 1), 0);
  EXPECT_EQ(buffer[0], '#');
  EXPECT_EQ(LXGetDataLocation(buffer, 12, 0), 12);
  EXPECT_STREQ(buffer, "/some/where");
  EXPECT_EQ(LXGetDataLocation(buffer, 17, 1), 17);
  EXPECT_STREQ(buffer, "/Tessarin/locale");
}

}  // namespace
}  // namespace lx::test
