// What check says when something in a compiled directory is broken.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <functional>
#include <sstream>

#include "check.h"
#include "compile.h"
#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

namespace fs = std::filesystem;

void write_text(const fs::path& path, const std::string& text) {
  fs::create_directories(path.parent_path());
  std::ofstream(path, std::ios::binary) << text;
}

/// A directory of sources with one object of each type, and its compiled form beside it.
class DirectoryTest : public testing::Test {
 protected:
  void SetUp() override {
    root_ = fs::path(testing::TempDir()) /
            (std::string("lexicor-data-") + testing::UnitTest::GetInstance()->current_test_info()->name());
    fs::remove_all(root_);
    write_text(source() / "control.txt",
               "language 1 English\nterritory 840 UnitedStates\ncodepage 819 Latin1\nsort 1 Default\n");
    write_text(source() / "sorts/Default.txt",
               "@defaults 0001 0001\n0061 ; [.0200.0001.0001]\n0041 ; [.0200.0001.0002]\n"
               "00E6 ; [.0200.0002.0001][.0201.0001.0001]\n0062 0063 ; [.0203.0001.0001]\n"
               "@uncovered 0100..FFFF\n");
    write_text(source() / "alias.txt", "Latin1 L1\n");
    for (const char* file : {"languages/English.toml", "territories/UnitedStates.toml"}) {
      const ByteVector shipped = read_file(std::string(LEXICOR_DATA_DIR) + '/' + file);
      std::string text(shipped.begin(), shipped.end());
      if (const size_t at = text.find("UTF-8"); at != std::string::npos) text.replace(at, 5, "Latin1");
      write_text(source() / file, text);
    }
    write_text(source() / "codepages/Latin1.ucm", euc_table());
    compile();
  }
  void TearDown() override { fs::remove_all(root_); }

  fs::path source() const { return root_ / "src"; }
  fs::path out() const { return root_ / "out"; }

  void compile() {
    std::ostringstream log;
    compile_directory(source().string(), out().string(), {}, log);
  }

  /// A small multibyte table, so that every part of an object is there.
  static std::string euc_table() {
    CodepageSource table;
    table.name = "Latin1", table.kind = CodepageClass::kMultiByte;
    table.width = table.leads[0x8F] = 3, table.leads[0xA3] = 2;
    for (uint32_t u = 0; u < 0x80; ++u) table.mappings.push_back({u, u, 1, 0});
    for (uint32_t u = 0xFF01; u < 0xFF5F; ++u) table.mappings.push_back({u, 0xA3A1 + u - 0xFF01, 2, 0});
    for (uint32_t u = 0x4E00; u < 0x4E40; ++u) table.mappings.push_back({u, 0x8FA1A1 + u - 0x4E00, 3, 0});
    std::ostringstream text;
    write_ucm(text, table);
    return text.str();
  }

 private:
  fs::path root_;
};

TEST_F(DirectoryTest, CheckFindsWhatIsBroken) {
  auto put = [](size_t at, uint16_t value) {
    return [=](ByteVector& bytes) { lx::put_le16(&bytes.at(at), value); };
  };
  namespace cp = lx::format::codepage;
  constexpr size_t kPayload = lx::format::kHeaderBytes;
  const struct {
    const char* file;
    std::function<void(ByteVector&)> change;
    const char* fault;
  } cases[] = {
      {"control.nls", put(0, 0), "magic"},
      {"control.nls", put(8, 5), "section count"},
      {"control.nls", put(10, 113), "whole number"},
      {"control.nls", put(kPayload + 2, 3), "types do not ascend"},
      {"la_00001.nls", put(4, 0), ""},
      {"la_00001.nls", put(6, 0x1000), "format version is 1"},
      {"la_00001.nls", put(10, 0xFFFF), "lies outside the file"},
      {"la_00001.nls", put(kPayload, 7), "default territory 7"},
      {"la_00001.nls", put(kPayload + 4, 9), "default sort 9"},
      {"la_00001.nls", put(kPayload + 10, 0xFFF0), "section 0, offset 10: a text does not end"},
      {"la_00001.nls", put(kPayload + 6, 0x7FFF), "special mappings"},
      {"la_00001.nls", put(kPayload + 102, 'X'), "checksum"},
      {"te_00840.nls", put(kPayload + 44, 191), "section 0, offset 42: a text does not end before"},
      {"te_00840.nls",
       [](ByteVector& bytes) {
         bytes.push_back(0);
         ++bytes[lx::format::header_section_size(0)];
       },
       "word 22"},
      {"te_00840.nls", put(kPayload + 16, 5), "sign position"},
      {"cp_00819.nls", put(kPayload + cp::kWidth, 0), "width"},
      {"cp_00819.nls", put(kPayload + cp::kLengths, 0x0909), "section 0, offset 10: the length of a byte"},
      {"cp_00819.nls", put(kPayload + cp::kPages + 4, 0xFFFF),
       "offset 2316: a page leads outside the low array"},
      {"cp_00819.nls", put(kPayload + cp::kFullWidth, 0xFFF0), "full-width table"},
      {"cp_00819.nls", put(kPayload + cp::kPairCount, 0xFFFF), "width pairs"},
      {"cp_00819.nls", put(kPayload + cp::kTypeTrie, 0xFFFC), "type trie"},
      {"cp_00819.nls", put(kPayload + cp::kTypeRecords, 0xFFFC), "type trie"},
      {"cp_00819.nls", put(kPayload + cp::kUnicodeValues, 0xFFFF), "Unicode trie"},
      {"alias.txt", [](ByteVector& bytes) { bytes[0] = 'Z'; }, "no codepage has the name Zatin1"},
  };
  for (const auto& test : cases) {
    SCOPED_TRACE(std::string(test.file) + ": " + test.fault);
    const std::string path = (out() / test.file).string();
    const ByteVector sound = read_file(path);
    ByteVector broken = sound;
    test.change(broken);
    write_file(path, broken);
    const auto faults = check_compiled_directory(out().string());
    write_file(path, sound);
    if (*test.fault == '\0') {
      EXPECT_TRUE(faults.empty()) << "the low bits of the format word mean nothing";
      continue;
    }
    ASSERT_FALSE(faults.empty());
    EXPECT_NE(faults[0].find(test.fault), std::string::npos) << faults[0];
  }
}

// Whatever a byte of an object becomes, checking and dumping end with a result or a SourceError.
TEST_F(DirectoryTest, AnyByteMayBeWrong) {
  for (const ObjectName& name : read_source_control(source().string()).objects) {
    const ByteVector sound = read_file((out() / object_file_name(name)).string());
    size_t refused = 0;
    auto dump = [&](const ByteVector& bytes) {
      try {
        dump_object(read_object(bytes, "object"), name, nullptr, "object");
      } catch (const SourceError&) {
        ++refused;
      }
    };
    uint32_t step = 0;
    for (size_t at = 0; at < sound.size(); at += 1 + step % 23, ++step) {
      ByteVector bytes = sound;
      bytes[at] = static_cast<uint8_t>(bytes[at] ^ (1U << step % 8));
      dump(bytes);
      bytes[at] = 0xFF;
      dump(bytes);
    }
    for (size_t size = 0; size < sound.size(); size += 1 + size / 16)
      dump(ByteVector(sound.begin(), sound.begin() + static_cast<std::ptrdiff_t>(size)));
    EXPECT_GT(refused, 0U) << name.name;
  }
}

}  // namespace
}  // namespace lexicor_data
