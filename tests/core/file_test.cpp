// Files and paths: temporary files that replace their target on close, the rules on descriptors, return codes,
// seeking, path parts and the case-blind comparison.
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstring>

#include "core/library_fixture.h"
#include "support/case_rows.h"

namespace lx::test {
namespace {

class FileTest : public LibraryTest {
 protected:
  void SetUp() override {
    LibraryTest::SetUp();
    ASSERT_EQ(init(), LX_W_DEFAULTS);
  }
  LXFile* open_file(const std::string& name, int32_t mode, int32_t no_temporary = 0) {
    return LXOpenFile(1, directory.file(name).c_str(), mode, no_temporary, &rc);
  }
  void put(LXFile* file, const char* text) {
    ASSERT_NE(file, nullptr);
    ASSERT_EQ(::write(file->descriptor, text, strlen(text)), static_cast<ssize_t>(strlen(text)));
  }
  std::string text_of(const std::string& name) {
    const ByteString content = directory.read(name);
    return std::string(content.begin(), content.end());
  }

  int32_t rc = -1;
};

TEST_F(FileTest, AnExistingFileWhoseNameIsTooLongToKeepIsNotReplaced) {
  directory.write_text("fourteen-bytes", "old");
  std::string name = "fourteen-bytes";
  while (directory.file(name).size() + 1 < 256) name.insert(0, "./");
  if (directory.file(name).size() < 256) name.insert(0, "/");
  EXPECT_EQ(open_file(name, LX_WRITE), nullptr);
  EXPECT_EQ(rc, LX_E_OPEN);
  EXPECT_EQ(text_of("fourteen-bytes"), "old");
}

// Parts that are too long are empty, and the temporary file and what it replaces are named from the parts that
// remain.
TEST_F(FileTest, AnExistingFileIsReplacedOnClose) {
  struct Case {
    const char* name;
    const char* temporary;  // its drive, directory and file parts, then "tmp"
    const char* final;      // what those parts and the extension name
  };
  const Case cases[] = {
      {"plain.txt", "plaintmp", "plain.txt"},
      {"two.dots.txt", "two.dotstmp", "two.dots.txt"},
      {"fourteen-bytes.abc", "fourteen-bytestmp", "fourteen-bytes.abc"},
      {"fifteen-bytes-x.abc", "tmp", ".abc"},
      {"name.long", "nametmp", "name"},
  };
  std::vector<std::string> said;
  for (const Case& c : cases) {
    SCOPED_TRACE(c.name);
    directory.write_text(c.final, "old");
    directory.write_text(c.name, "old");
    for (const int32_t discard : {1, 0}) {
      said = messages(RAS1_LEVEL_DETAIL, [&] {
        LXFile* const file = open_file(c.name, LX_WRITE);
        put(file, "new");
        EXPECT_EQ(rc, LX_OK);
        EXPECT_TRUE(directory.exists(c.temporary));
        EXPECT_EQ(LXCloseFile(file, discard), 0);
      });
      EXPECT_FALSE(directory.exists(c.temporary));
      EXPECT_EQ(text_of(c.final), discard != 0 ? "old" : "new");
    }
    EXPECT_EQ(text_of(c.name), c.name == std::string(c.final) ? "new" : "old");
    EXPECT_EQ(said.at(1), "Using temp file " + directory.file(c.temporary));
    EXPECT_EQ(said.at(2), "Renaming " + directory.file(c.temporary) + " to " + directory.file(c.final));
    if (&c == cases) {
      const std::string& path = directory.path();
      EXPECT_EQ(said.at(0), "Original path: " + path + "/plain.txt\n drive: \n directory: " + path +
                                "/\n file: plain\n extent: .txt");
    }
  }
}

TEST_F(FileTest, AFailedReplacementIsSaidAlone) {
  directory.write_text("gone", "old");
  LXFile* const file = open_file("gone", LX_WRITE);
  unlink(directory.file("gone").c_str());
  EXPECT_EQ(messages(RAS1_LEVEL_ERRORS, [&] { EXPECT_EQ(LXCloseFile(file, 0), 0); }),
            std::vector<std::string>{"Close failed, rc = 2"});
  EXPECT_FALSE(directory.exists("gone"));
}

TEST_F(FileTest, NewFilesAndUnprotectedOnesAreWrittenInPlace) {
  const mode_t mask = umask(022);
  LXFile* file = open_file("fresh.txt", LX_WRITE);
  umask(mask);
  put(file, "one");
  EXPECT_EQ(text_of("fresh.txt"), "one");
  struct stat status;
  ASSERT_EQ(stat(directory.file("fresh.txt").c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 07777, 0644u);
  EXPECT_EQ(LXCloseFile(file, 1), 0) << "there is nothing to discard";
  file = open_file("fresh.txt", LX_WRITE, 1);
  put(file, "2");
  EXPECT_EQ(text_of("fresh.txt"), "2");
  EXPECT_EQ(LXCloseFile(file, 0), 0);
  EXPECT_FALSE(directory.exists("freshtmp"));
}

// Creation is checked against 0, not against -1: both are kept.
TEST_F(FileTest, DescriptorRulesOfCreation) {
  LXFile* file = open_file("missing/new.txt", LX_WRITE);
  ASSERT_NE(file, nullptr);
  EXPECT_EQ(rc, LX_OK);
  EXPECT_EQ(file->descriptor, -1);
  EXPECT_NE(LXCloseFile(file, 0), 0);

  const int saved = dup(0);
  close(0);
  LXFile* const created = open_file("zero.txt", LX_WRITE, 1);
  const int32_t write_code = rc;
  const int left_open = close(0);
  file = open_file("zero.txt", LX_READ);
  const int32_t read_descriptor = file != nullptr ? file->descriptor : -2;
  if (file != nullptr) LXCloseFile(file, 0);
  dup2(saved, 0);
  close(saved);
  EXPECT_EQ(created, nullptr);
  EXPECT_EQ(write_code, LX_E_OPEN);
  EXPECT_EQ(left_open, -1) << "the descriptor is closed";
  EXPECT_EQ(read_descriptor, 0) << "reading takes any descriptor";
}

TEST_F(FileTest, CodesOfOpeningAndReading) {
  directory.write_text("data.txt", "text");
  directory.write_text("secret", "text");
  ASSERT_EQ(chmod(directory.file("secret").c_str(), 0), 0);
  const struct {
    const char* name;
    int32_t mode, open_code, read_code;
  } rows[] = {{"none", LX_READ, LX_E_FILE_NOT_FOUND, 0}, {"none", LX_READ_WRITE, LX_E_FILE_NOT_FOUND, 0},
              {"data.txt/none", LX_READ, LX_E_OPEN, 0},  {"data.txt/none", LX_READ_WRITE, LX_E_OPEN, 0},
              {".", LX_READ_WRITE, LX_E_OPEN, 0},        {"data.txt", 3, LX_E_OPEN, 0},
              {"secret", LX_READ, LX_E_FILE_ACCESS, 0},  {".", LX_READ, LX_OK, LX_E_FILE_IO},
              {"new", LX_WRITE, LX_OK, LX_E_FILE_MODE}};
  constexpr uid_t kNobody = 65534;
  const uid_t user = geteuid();
  for (const auto& row : rows) {
    if (row.open_code == LX_E_FILE_ACCESS && user == 0 && seteuid(kNobody) != 0) continue;
    SCOPED_TRACE(row.name + std::to_string(row.mode));
    LXFile* const file = open_file(row.name, row.mode);
    ASSERT_EQ(seteuid(user), 0);
    EXPECT_EQ(rc, row.open_code);
    EXPECT_EQ(file != nullptr, row.open_code == LX_OK);
    if (file == nullptr) continue;
    char byte;
    EXPECT_EQ(LXReadFile(file, &byte, 1, &rc), 0);
    EXPECT_EQ(rc, row.read_code);
    EXPECT_EQ(LXLoadFile(file, 0, 1, &rc), nullptr);
    EXPECT_EQ(rc, row.read_code);
    EXPECT_EQ(LXCloseFile(file, 0), 0);
  }
}

TEST_F(FileTest, ReadsSeeksAndLoads) {
  directory.write_text("data.txt", "0123456789");
  LXFile* file = open_file("data.txt", LX_READ_WRITE);
  ASSERT_NE(file, nullptr);
  EXPECT_EQ(LXFileSize(file), 10);
  char buffer[20] = {};
  const struct {
    int32_t offset, origin, result;
    char next;
  } seeks[] = {{4, LX_FROM_START, 0, '4'},
               {2, LX_FROM_HERE, 0, '7'},
               {-3, LX_FROM_END, 0, '7'},
               {3, 0, 0, '3'},
               {5, 13, 0, '5'},
               {-1, LX_FROM_START, 1, '6'},
               {-11, LX_FROM_END, 1, '7'},
               {0, LX_FROM_START, 0, '0'}};
  for (const auto& seek : seeks) {
    EXPECT_EQ(LXSeekFile(file, seek.offset, seek.origin), seek.result) << seek.next;
    EXPECT_EQ(LXReadFile(file, buffer, 1, &rc), 1);
    EXPECT_EQ(buffer[0], seek.next);
  }
  EXPECT_EQ(LXReadFile(file, buffer, 20, &rc), 9);
  EXPECT_EQ(rc, LX_OK);
  EXPECT_STREQ(buffer, "123456789");
  EXPECT_EQ(LXReadFile(file, buffer, 20, &rc), 0);
  EXPECT_EQ(rc, LX_OK) << "the end of the file is no failure";

  const struct {
    uint32_t offset;
    int32_t bytes, code;
    const char* text;
  } loads[] = {{0, 10, LX_OK, "0123456789"},
               {7, 3, LX_OK, "789"},
               {7, 4, LX_E_FILE_IO, "none"},
               {0xFFFFFFFF, 1, LX_E_FILE_IO, "none"},
               {0, 0, LX_OK, "none"}};
  for (const auto& load : loads) {
    SCOPED_TRACE(load.offset);
    rc = -1;
    void* block = LXLoadFile(file, load.offset, load.bytes, &rc);
    EXPECT_EQ(rc, load.code);
    EXPECT_EQ(
        block != nullptr ? std::string(static_cast<char*>(block), static_cast<size_t>(load.bytes)) : "none",
        load.text);
    hooks.fail_frees(true);
    EXPECT_EQ(LXUnloadFile(block), 0) << "it never fails";
    hooks.fail_frees(false);
  }
  EXPECT_EQ(LXCloseFile(file, 0), 0);
}

TEST(PathTest, Parts) {
  for (const CaseRow& row : case_rows("core/path_parts.txt")) {
    SCOPED_TRACE(row.where);
    const char* const path = row[0].c_str();
    char parts[4][256] = {"###", "#", "#", "#"};
    EXPECT_EQ(SplitDrive(path, parts[0]), static_cast<int32_t>(row[1].size()));
    EXPECT_EQ(SplitDir(path, parts[1]), static_cast<int32_t>(row[2].size()));
    EXPECT_EQ(SplitFile(path, parts[2]), static_cast<int32_t>(row[3].size()));
    EXPECT_EQ(SplitExtent(path, parts[3]), static_cast<int32_t>(row[4].size()));
    for (int round = 0; round < 2; ++round) {
      for (size_t i = 0; i < 4; ++i) EXPECT_EQ(parts[i], row[i + 1]);
      SplitPath(path, parts[0], parts[1], parts[2], parts[3]);
    }
  }
}

TEST(PathTest, ComparesWithoutCase) {
  EXPECT_EQ(LXmemicmp("BINARY", "binarY", 6), 0);
  EXPECT_EQ(LXmemicmp("abcX", "ABCy", 4), 'x' - 'y');
  EXPECT_EQ(LXmemicmp("_", "A", 1), '_' - 'a') << "the lowered bytes are compared";
  EXPECT_EQ(LXmemicmp("\xFF", "\x01", 1), 0xFE) << "bytes have no sign";
  EXPECT_EQ(LXmemicmp("a\0b", "A\0C", 3), 'b' - 'c') << "a null is a byte like any other";
  EXPECT_EQ(LXmemicmp("a", "b", 0), 0);
}

}  // namespace
}  // namespace lx::test
