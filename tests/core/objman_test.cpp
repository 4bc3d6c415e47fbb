// The object manager: where the control file is searched, look-ups by name and identifier, loading, and the
// built-in data that stand in.
#include <strings.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cstring>
#include <filesystem>
#include <thread>

#include "core/tiny_directory.h"
#include "support/case_rows.h"

namespace lx::test {
namespace {

class ObjManTest : public LibraryTest {
 protected:
  static LXObject* by_name(int32_t type, const std::string& name, int32_t mode = LX_FIND_AND_LOAD) {
    return LXGetObjFromName(nullptr, type, name.c_str(), static_cast<int32_t>(name.size()), mode, &rc);
  }
  static LXObject* by_id(int32_t type, uint16_t id, int32_t mode = LX_FIND_AND_LOAD) {
    return LXGetObjFromID(nullptr, type, id, mode, &rc);
  }
  /// A directory with one language, so that it can be told which control file was read.
  static void write_marker(const ScratchDirectory& scratch, const std::string& language) {
    scratch.write("control.nls", control_file({{1, LX_LANGUAGE, language}}));
  }
  static int32_t rc;
};
int32_t ObjManTest::rc;

std::string name_of(const LXObject* object) {
  return object != nullptr ? object->disk.name : "";
}

TEST_F(ObjManTest, SearchOrder) {
  if (access(kDefaultControl, F_OK) == 0) GTEST_SKIP();
  ScratchDirectory environment;
  const std::string none = directory.file("none");
  const std::string control = "/control.nls";
  // A control-file name takes 13 bytes beside the directory, in 256.
  const std::string longest(243, 'x');
  const std::string too_long(244, 'x');
  write_marker(directory, "Given");
  write_marker(environment, "Environment");
  const std::string given = directory.path();
  const std::string env = environment.path();
  const std::string over_buffer(256, 'x');
  struct Case {
    const char* what;
    const std::string* given;
    const std::string* env;
    int32_t code;
    const char* language;
    std::vector<std::string> opened;
  };
  const Case cases[] = {
      {"the directory given", &given, &env, LX_OK, "Given", {given + control}},
      {"none given", nullptr, &env, LX_OK, "Environment", {env + control}},
      {"the longest name goes on", &longest, &env, LX_OK, "Environment", {longest + control, env + control}},
      {"a longer one ends the search", &too_long, &env, LX_E_FILE_IO, "English", {}},
      {"nothing at all", nullptr, nullptr, LX_E_FILE_NOT_FOUND, "English", {kDefaultControl}},
      {"a variable whose control file's name does not fit", nullptr, &too_long, LX_E_FILE_IO, "English", {}},
      {"a variable that does not fit", &none, &over_buffer, LX_E_FILE_IO, "English", {none + control}},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.what);
    c.env != nullptr ? setenv("LX_LOCALEDIR", c.env->c_str(), 1) : unsetenv("LX_LOCALEDIR");
    std::vector<std::string> paths = opened([&] {
      EXPECT_EQ(init(c.given != nullptr ? c.given->c_str() : nullptr), c.code == LX_OK ? LX_OK : LX_W_DEFAULTS);
    });
    if (!paths.empty() && paths.back().find("/alias.txt") != std::string::npos) paths.pop_back();
    EXPECT_EQ(paths, c.opened);
    EXPECT_EQ(name_of(by_id(LX_LANGUAGE, 1, LX_FIND_ONLY)), c.language);
    LXObjManager* own = LXInitObjManager(c.given != nullptr ? c.given->c_str() : nullptr, 0, &rc);
    EXPECT_EQ(rc, c.code);
    ASSERT_NE(own, nullptr);
    EXPECT_EQ(LXTermObjManager(own), LX_OK);
    EXPECT_EQ(LXTerm(), LX_OK);
  }
}

TEST_F(ObjManTest, AControlFileThatOpensEndsTheSearch) {
  ScratchDirectory environment;
  write_marker(environment, "Environment");
  setenv("LX_LOCALEDIR", environment.path().c_str(), 1);
  const ByteString whole = control_file({{1, LX_LANGUAGE, "Given"}});
  struct Case {
    const char* what;
    ByteString content;
    int32_t code;
  };
  std::vector<Case> cases = {{"half a header", ByteString(whole.begin(), whole.begin() + 40), LX_E_FILE_IO},
                             {"wrong magic number", whole, LX_E_CORRUPT},
                             {"a table beyond the end", whole, LX_E_FILE_IO},
                             {"a table before the start", whole, LX_E_FILE_IO}};
  cases[1].content[0] ^= 1;
  put_le32(cases[2].content.data() + format::header_section_offset(0), 0x01000000);
  put_le32(cases[3].content.data() + format::header_section_offset(0), 0x80000000);
  for (const Case& c : cases) {
    SCOPED_TRACE(c.what);
    directory.write("control.nls", c.content);
    EXPECT_EQ(init(), LX_W_DEFAULTS);
    EXPECT_EQ(name_of(by_id(LX_LANGUAGE, 1, LX_FIND_ONLY)), "English");
    LXObjManager* own = LXInitObjManager(directory.path().c_str(), LX_NO_DEFAULTS, &rc);
    EXPECT_EQ(rc, c.code);
    ASSERT_NE(own, nullptr);
    EXPECT_EQ(LXGetObjFromID(own, LX_LANGUAGE, 1, LX_FIND_ONLY, &rc), nullptr);
    EXPECT_EQ(LXTermObjManager(own), LX_OK);
    EXPECT_EQ(LXTerm(), LX_OK);
  }
}

TEST_F(ObjManTest, TableAnywhereInTheFile) {
  const ByteString table = control_file({{1, LX_LANGUAGE, "One"}, {2, LX_LANGUAGE, "Two"}});
  ByteString moved(table.begin(), table.begin() + format::kHeaderBytes);
  moved.resize(moved.size() + 1000);
  moved.insert(moved.end(), table.begin() + format::kHeaderBytes, table.end());
  put_le32(moved.data() + format::header_section_offset(0), format::kHeaderBytes + 1000);
  // Bytes behind the last whole record do not count.
  put_le16(moved.data() + format::header_section_size(0), 2 * format::kRecordBytes - 1);
  directory.write("control.nls", moved);
  ASSERT_EQ(init(), LX_OK);
  EXPECT_EQ(name_of(by_id(LX_LANGUAGE, 1, LX_FIND_ONLY)), "One");
  EXPECT_EQ(by_id(LX_LANGUAGE, 2, LX_FIND_ONLY), nullptr);
}

TEST_F(ObjManTest, EveryEntryIsFoundAndNoOther) {
  std::vector<ControlRecord> tables[] = {
      {{1, LX_LANGUAGE, "English"}, {367, LX_CODEPAGE, "US-ASCII"}, {850, LX_CODEPAGE, "IBM-850"}},
      {{7, LX_SORT, "Default"}},
      {{7, LX_LANGUAGE, "German"}, {8, LX_LANGUAGE, "Greek"}},
      {},
      {{3, LX_LANGUAGE, "L"}},
  };
  for (int id : {0, 1, 3, 4, 100, 0x7FFF, 0x8000, 0xFFFF})
    tables[4].push_back({static_cast<uint16_t>(id), LX_CODEPAGE, "C" + std::to_string(id)});
  for (const std::vector<ControlRecord>& records : tables) {
    SCOPED_TRACE(records.size());
    directory.write("control.nls", control_file(records));
    ASSERT_EQ(init(), LX_OK);
    for (int32_t type : {-1, 0, 1, 2, 3, 4}) {
      for (const ControlRecord& record : records) {
        LXObject* found = by_name(type, record.name, LX_FIND_ONLY);
        EXPECT_EQ(name_of(found), type == record.type ? record.name : "") << type;
        EXPECT_EQ(rc, type == record.type ? LX_OK : LX_E_NOT_FOUND);
        if (type != record.type) continue;
        EXPECT_EQ(by_id(type, record.id, LX_FIND_ONLY), found);
        const auto next = static_cast<uint16_t>(record.id + 1);
        const auto is_next = [&](const ControlRecord& r) { return r.type == type && r.id == next; };
        EXPECT_EQ(by_id(type, next, LX_FIND_ONLY) != nullptr,
                  std::any_of(records.begin(), records.end(), is_next));
      }
      EXPECT_EQ(by_id(type, 9999, LX_FIND_ONLY), nullptr);
      EXPECT_EQ(rc, LX_E_NOT_FOUND);
    }
    EXPECT_EQ(LXTerm(), LX_OK);
  }
}

// Callers rely on it: for a type without entries the entry before its range is looked at, or the first of the
// table.
TEST_F(ObjManTest, ByIdReturnsTheNeighbourOfAnEmptyRange) {
  directory.write("control.nls", control_file({{5, LX_TERRITORY, "A"}, {6, LX_TERRITORY, "B"}}));
  ASSERT_EQ(init(), LX_OK);
  EXPECT_EQ(name_of(by_id(LX_LANGUAGE, 5, LX_FIND_ONLY)), "A");
  EXPECT_EQ(rc, LX_OK);
  EXPECT_EQ(by_id(LX_LANGUAGE, 6, LX_FIND_ONLY), nullptr);
  EXPECT_EQ(name_of(by_id(LX_CODEPAGE, 6, LX_FIND_ONLY)), "B");
  EXPECT_EQ(by_id(LX_CODEPAGE, 5, LX_FIND_ONLY), nullptr);
  EXPECT_EQ(rc, LX_E_NOT_FOUND);
  EXPECT_EQ(name_of(by_id(LX_SORT, 6, LX_FIND_ONLY)), "B");
}

TEST_F(ObjManTest, ByName) {
  std::vector<ControlRecord> languages;
  for (const std::string& name : {std::string("English"), std::string("English (Old)"), std::string(33, 'L'),
                                  std::string("ENGLISH"), std::string(34, 'M')})
    languages.push_back({static_cast<uint16_t>(languages.size() + 1), LX_LANGUAGE, name});
  directory.write("control.nls", control_file(languages));
  ASSERT_EQ(init(), LX_OK);
  for (const CaseRow& row : case_rows("core/names_in_table.txt")) {
    SCOPED_TRACE(row.where);
    const int32_t length = row.number(1), code = row.number(2) != 0 ? LX_OK : LX_E_NOT_FOUND;
    LXObject* object = LXGetObjFromName(nullptr, LX_LANGUAGE, row[0].c_str(), length, LX_FIND_ONLY, &rc);
    EXPECT_EQ(object != nullptr ? object->disk.id : 0, row.number(2));
    EXPECT_EQ(rc, code);
    const auto wide = widened<LXWChar>(row[0] + std::string(1, '\0'));
    EXPECT_EQ(LXGetObjFromNameW(nullptr, LX_LANGUAGE, wide.c_str(), length, LX_FIND_ONLY, &rc), object);
    EXPECT_EQ(rc, code);
  }
  const LXWChar beyond[] = {'E' + 0x100, 'n', 'g', 'l', 'i', 's', 'h', 0};
  EXPECT_EQ(LXGetObjFromNameW(nullptr, LX_LANGUAGE, beyond, 7, LX_FIND_ONLY, &rc), nullptr);
}

TEST_F(ObjManTest, BinaryOrderHasNoObject) {
  directory.write("control.nls",
                  control_file({{1, LX_LANGUAGE, "BINARY"}, {0, LX_SORT, "Zero"}, {9, LX_SORT, "BINARY"}}));
  ASSERT_EQ(init(), LX_OK);
  for (int32_t mode : {LX_FIND_AND_LOAD, LX_FIND_ONLY}) {
    for (const char* name : {"BINARY", "bInArY", "BINARYX", "BINARX", "BINAR"}) {
      EXPECT_EQ(LXGetObjFromName(nullptr, LX_SORT, name, 6, mode, &rc), nullptr) << name;
      EXPECT_EQ(rc, strncasecmp(name, "BINARY", 6) == 0 ? LX_OK : LX_E_NOT_FOUND) << name;
    }
    EXPECT_EQ(by_name(LX_SORT, "BINARYX", mode), nullptr);
    EXPECT_EQ(rc, LX_E_NOT_FOUND);
    EXPECT_EQ(by_id(LX_SORT, 0, mode), nullptr);
    EXPECT_EQ(rc, LX_OK);
  }
  EXPECT_EQ(name_of(by_name(LX_LANGUAGE, "BINARY", LX_FIND_ONLY)), "BINARY");
  EXPECT_EQ(name_of(by_id(LX_SORT, 9, LX_FIND_ONLY)), "BINARY");
}

TEST_F(ObjManTest, LoadsOnFirstUseAndKeeps) {
  std::vector<ByteString> sections = tiny_shift_jis().file.sections;
  sections.resize(4);
  sections[3] = {1, 2, 3};
  directory.write_locale({{850, "Tiny", sections}, {851, "Old", version1_ascii_codepage(), 1}});
  ASSERT_EQ(init(), LX_OK);
  LXObject* found = by_name(LX_CODEPAGE, "tiny", LX_FIND_ONLY);
  ASSERT_NE(found, nullptr);
  const std::string path = directory.file("cp_00850.nls");
  EXPECT_EQ(opened([&] { EXPECT_EQ(by_id(LX_CODEPAGE, 850, 2), found); }), std::vector<std::string>{path});
  EXPECT_EQ(rc, LX_OK);
  EXPECT_EQ(found->disk.flags, 0);
  for (size_t i = 0; i < sections.size(); ++i) {
    ASSERT_NE(found->section[i], nullptr) << i;
    EXPECT_EQ(memcmp(found->section[i], sections[i].data(), sections[i].size()), 0) << i;
  }
  EXPECT_EQ(opened([&] { EXPECT_EQ(by_name(LX_CODEPAGE, "TINY"), found); }), std::vector<std::string>{});
  LXObject* old = by_name(LX_CODEPAGE, "Old");
  ASSERT_NE(old, nullptr);
  EXPECT_EQ(rc, LX_OK);
  EXPECT_EQ(old->disk.flags, 0x02) << "the payload is a converted one";
  EXPECT_EQ(memcmp(old->section[0] + 10, ascii_codepage()[0].data() + 10, 256), 0);
}

TEST_F(ObjManTest, ReadsAsManySectionsAsCounted) {
  std::vector<ByteString> sections = tiny_shift_jis().file.sections;
  sections.resize(4);
  sections[3] = {1, 2, 3};
  ByteString file = object_file(sections);
  directory.write_locale({{850, "Tiny", ascii_codepage()}});
  // A multibyte codepage needs its first three; a count above four counts four.
  for (uint16_t counted : {uint16_t{2}, uint16_t{3}, uint16_t{4}, uint16_t{0xFFFF}}) {
    SCOPED_TRACE(counted);
    put_le16(file.data() + format::kHeaderSections, counted);
    directory.write("cp_00850.nls", file);
    ASSERT_EQ(init(), LX_OK);
    const LXObject* object = by_id(LX_CODEPAGE, 850);
    EXPECT_EQ(rc, counted < 3 ? LX_E_CORRUPT : LX_OK);
    ASSERT_NE(object, nullptr);
    EXPECT_EQ(object->section[3] != nullptr, counted > 3);
    EXPECT_EQ(LXTerm(), LX_OK);
  }
}

class LoadFailure : public ObjManTest {
 protected:
  struct Object {
    int32_t type;
    uint16_t id;
    const char* file;
    const BuiltIn* built_in;
  };
  static constexpr uint16_t kSortId = 4;
  const Object objects[4] = {{LX_LANGUAGE, 1, "la_00001.nls", &kBuiltInLanguage},
                             {LX_TERRITORY, 840, "te_00840.nls", &kBuiltInTerritory},
                             {LX_CODEPAGE, 850, "cp_00850.nls", &kBuiltInCodepage},
                             {LX_SORT, kSortId, "so_00004.nls", nullptr}};

  void write_all() {
    for (const Object& object : objects) std::filesystem::remove(directory.file(object.file));
    directory.write_locale({{850, "Tiny", tiny_shift_jis().file.sections}});
    directory.write("so_00004.nls", object_file({SortBuilder{}.payload()}));
    directory.write("control.nls", control_file({{1, LX_LANGUAGE, "English"},
                                                 {840, LX_TERRITORY, "UnitedStates"},
                                                 {850, LX_CODEPAGE, "Tiny"},
                                                 {kSortId, LX_SORT, "Default"}}));
  }
  void damage(const Object& object, int how) {
    ByteString content = directory.read(object.file);
    if (how == 1) content[3] ^= 0x80;
    if (how == 2) content.pop_back();
    if (how == 3) put_le16(content.data() + format::header_section_size(0), 0);
    if (how == 4) put_le32(content.data() + format::header_section_offset(0), 0xFFFFFFFF);
    std::filesystem::remove(directory.file(object.file));
    if (how == 5) std::filesystem::create_directory(directory.file(object.file));
    if (how == 6) mkfifo(directory.file(object.file).c_str(), 0600);  // does not wait for a writer
    if (how >= 1 && how <= 4) directory.write(object.file, content);
  }
  static constexpr int32_t kCodes[] = {LX_E_FILE_NOT_FOUND, LX_E_CORRUPT, LX_E_FILE_IO, LX_E_CORRUPT,
                                       LX_E_FILE_IO,        LX_E_FILE_IO, LX_E_OPEN};
  static constexpr int kDamages = 7;
};

TEST_F(LoadFailure, BuiltInDataStandInAndTheCodeIsKept) {
  const int descriptor = dup(0);
  ASSERT_GE(descriptor, 0);
  close(descriptor);
  for (int round = 0; round < 8 * kDamages; ++round) {
    const Object& object = objects[round / 2 % 4];
    const int how = round / 8;
    const bool stands_in = round % 2 == 0 && object.built_in != nullptr;
    SCOPED_TRACE(std::string(object.file) + ", round " + std::to_string(round));
    write_all();
    damage(object, how);
    ASSERT_EQ(init(directory.path().c_str(), round % 2 == 0 ? 0 : LX_NO_DEFAULTS), LX_OK);
    const LXObject* entry = by_id(object.type, object.id, LX_FIND_ONLY);
    ASSERT_NE(entry, nullptr);
    EXPECT_EQ(by_id(object.type, object.id), stands_in ? entry : nullptr);
    EXPECT_EQ(rc, kCodes[how]);
    EXPECT_EQ(entry->file, nullptr);
    EXPECT_EQ(entry->disk.id, object.id);
    EXPECT_EQ(entry->disk.flags, stands_in ? 0x01 : 0);
    for (size_t i = 0; i < 4; ++i)
      EXPECT_EQ(entry->section[i], stands_in ? object.built_in->sections.section[i].data : nullptr);
    EXPECT_EQ(by_id(object.type, object.id), stands_in ? entry : nullptr) << "it is loaded now, or tried again";
    EXPECT_EQ(rc, stands_in ? LX_OK : kCodes[how]);
    write_all();
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
    std::atomic<int> waiting{kThreads};
    LXObject* found[kThreads] = {};
    bool loaded[kThreads] = {};
    const std::vector<std::string> paths = opened([&] {
      std::vector<std::thread> threads;
      for (int i = 0; i < kThreads; ++i)
        threads.emplace_back([&, i] {
          --waiting;
          while (waiting != 0) std::this_thread::yield();
          int32_t code = -1;
          found[i] = i % 2 == 0 ? LXGetObjFromID(nullptr, LX_CODEPAGE, 850, 0, &code)
                                : LXGetObjFromName(nullptr, LX_CODEPAGE, "Tiny", 4, 0, &code);
          loaded[i] =
              code == LX_OK && found[i]->section[1] != nullptr && LXMbToW(found[i], "\x82\x42") == 0x8242;
        });
      for (std::thread& thread : threads) thread.join();
    });
    EXPECT_EQ(paths.size(), 1u);
    for (int i = 0; i < kThreads; ++i) {
      EXPECT_EQ(found[i], found[0]);
      EXPECT_TRUE(loaded[i]);
    }
    EXPECT_EQ(LXTerm(), LX_OK);
  }
}

TEST_F(ObjManTest, FileAndDirectoryNames) {
  char buffer[32];
  EXPECT_EQ(LXGetControlFileName("/d", buffer, 15), buffer);
  EXPECT_STREQ(buffer, "/d/control.nls");
  strcpy(buffer, "#");
  EXPECT_EQ(LXGetControlFileName("/d", buffer, 14), nullptr);
  EXPECT_EQ(LXGetControlFileName("/directory", buffer, 5), nullptr);
  EXPECT_STREQ(buffer, "#");

  ASSERT_EQ(init(), LX_W_DEFAULTS);
  EXPECT_EQ(LXGetDataFileName("/d", LX_SORT, 1, buffer, 16), buffer);
  EXPECT_STREQ(buffer, "/d/so_00001.nls");
  ::testing::internal::CaptureStderr();
  EXPECT_EQ(LXGetDataFileName("/d", LX_SORT, 1, buffer, 15), nullptr);
  EXPECT_EQ(::testing::internal::GetCapturedStderr(), "Buffer provided = 15, needed = 16\n");
  EXPECT_EQ(LXGetDataFileName("/d", 4, 1, buffer, sizeof(buffer)), nullptr);
  EXPECT_EQ(LXGetDataFileName("/d", -1, 1, buffer, sizeof(buffer)), nullptr);
  strcpy(buffer, "#");
  EXPECT_EQ(LXGetDataLocation(buffer, sizeof(buffer), 0), -1);
  setenv("LX_LOCALEDIR", "/some/where", 1);
  EXPECT_EQ(LXGetDataLocation(buffer, 11, 0), 0);
  EXPECT_EQ(LXGetDataLocation(buffer, 16, 1), 0);
  EXPECT_EQ(buffer[0], '#');
  EXPECT_EQ(LXGetDataLocation(buffer, 12, 0), 12);
  EXPECT_STREQ(buffer, "/some/where");
  EXPECT_EQ(LXGetDataLocation(buffer, 17, 1), 17);
  EXPECT_STREQ(buffer, "/Tessarin/locale");
}

/// A control file that is not grouped by type: what stands in the codepages' range is no codepage by that
/// alone.
TEST_F(ObjManTest, AnotherTypeInTheRangeIsNotFoundByName) {
  directory.write_locale({{850, "Tiny", ascii_codepage()}});
  directory.write("te_00841.nls", directory.read("te_00840.nls"));
  directory.write(
      "control.nls",
      control_file({{1, 0, "English"}, {840, 1, "UnitedStates"}, {850, 2, "Tiny"}, {841, 1, "Odd"}}));
  ASSERT_EQ(init(), LX_OK);
  EXPECT_EQ(LXGetObjFromName(nullptr, LX_CODEPAGE, "Odd", 3, LX_FIND_ONLY, &rc), nullptr);
  EXPECT_EQ(rc, LX_E_NOT_FOUND);
  EXPECT_EQ(LXGetLocale("English_UnitedStates.Odd", 0, &rc), nullptr);
  EXPECT_EQ(rc, LX_E_NO_CODEPAGE);
}

}  // namespace
}  // namespace lx::test
