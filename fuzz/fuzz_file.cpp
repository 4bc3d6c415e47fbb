// Paths, comparison without regard to case and files: paths are divided and joined again, and a file is read in pieces as
// it was written.
#include <cctype>
#include <cstring>
#include <vector>

#include "fuzz.h"
#include "support/object_files.h"

namespace lx::fuzz::file {
namespace {

void divide(const std::string& path) {
  const Block<char> given(path + '\0');
  const Block<char> drive(4), directory(256), name(15), extension(5);
  const Block<char> drive2(4), directory2(256), name2(15), extension2(5);
  SplitPath(given.data(), drive.data(), directory.data(), name.data(), extension.data());
  const auto same = [](const Block<char>& part, const Block<char>& one, int32_t length) {
    must(strlen(part.data()) == static_cast<size_t>(length) && strcmp(part.data(), one.data()) == 0,
         "a part is the same alone");
  };
  same(drive, drive2, SplitDrive(given.data(), drive2.data()));
  same(directory, directory2, SplitDir(given.data(), directory2.data()));
  same(name, name2, SplitFile(given.data(), name2.data()));
  same(extension, extension2, SplitExtent(given.data(), extension2.data()));
  const std::string joined = std::string(drive.data()) + directory.data() + name.data() + extension.data();
  const Block<char> whole(joined.size() + 1);
  MakePath(whole.data(), drive.data(), directory.data(), name.data(), extension.data());
  must(joined == whole.data(), "a path is its parts");
  LXGetControlFileName(given.data(), whole.data(), whole.size());
  for (int32_t type = -1; type <= LX_SORT + 1; ++type)
    if (const char* made_name = LXGetDataFileName(given.data(), type, 819, whole.data(), whole.size()))
      must(strlen(made_name) < joined.size() + 1, "a name fits");
  const Block<char> exact(path.size() + 13);
  must(LXGetControlFileName(given.data(), exact.data(), exact.size()) != nullptr || path.empty() ||
           exact.size() < 13,
       "a name has room");
  const Block<char> data(path.size() + 14);
  must(LXGetDataFileName(given.data(), LX_SORT, 65535, data.data(), data.size()) != nullptr || path.empty(),
       "so has this");
}

void compare(const std::string& a, const std::string& b) {
  const size_t bytes = std::min(a.size(), b.size());
  int32_t expected = 0;
  for (size_t i = 0; i < bytes && expected == 0; ++i)
    expected = tolower(static_cast<uint8_t>(a[i])) - tolower(static_cast<uint8_t>(b[i]));
  must(LXmemicmp(Block<char>(a).data(), Block<char>(b).data(), bytes) == expected, "compared by small letters");
}

void read_file(Input& in, const std::string& content) {
  static const ScratchDirectory directory;
  directory.write_text("file", content);
  int32_t rc = -1;
  LXFile* const f = LXOpenFile(0, directory.file("file").c_str(), in.one_of({LX_READ, LX_READ_WRITE}), 1, &rc);
  must(f != nullptr && rc == LX_OK && LXFileSize(f) == count_of(content), "a file is opened");
  size_t at = 0;
  for (int i = 0; i < 8; ++i) {
    const int32_t offset = static_cast<int32_t>(in.number(2)) - 0x4000;
    if (in.flag() && offset >= 0 && LXSeekFile(f, offset, LX_FROM_START) == 0) at = static_cast<size_t>(offset);
    const Block<char> piece(in.below(40));
    const int32_t got = LXReadFile(f, piece.data(), piece.size(), &rc);
    const std::string expected =
        at < content.size() ? content.substr(at, static_cast<size_t>(piece.size())) : "";
    must(rc == LX_OK && std::string(piece.data(), static_cast<size_t>(got)) == expected, "a file is read");
    at += static_cast<size_t>(got);
    const auto from = static_cast<uint32_t>(in.below(50)), bytes = static_cast<uint32_t>(in.below(50));
    void* const block = LXLoadFile(f, from, static_cast<int32_t>(bytes), &rc);
    must((block != nullptr) == (bytes != 0 && from + bytes <= content.size()), "a part is loaded or not there");
    must(block == nullptr || memcmp(block, content.data() + from, bytes) == 0, "as it is");
    LXUnloadFile(block);
    LXSeekFile(f, static_cast<int32_t>(at), LX_FROM_START);
  }
  must(LXCloseFile(f, 0) == LX_OK, "a file is closed");
}

void blocks(Input& in) {
  const std::string content = in.bytes(40);
  void* const block = LXMcMalloc(content.size() + 1);
  LXMcSetZero(block, content.size() + 1);
  LXMcMemcpy(block, content.data(), content.size());
  const size_t bytes = 1 + in.below(80);
  void* const larger = LXMcRealloc(block, content.size() + 1, bytes);
  must(memcmp(larger, content.c_str(), std::min(bytes, content.size() + 1)) == 0, "a block keeps its content");
  must(LXMcFree(larger) == 1 && LXMcGetByteOrder() == 2, "a block is freed");
  void* const own = LXDefAlloc(nullptr, bytes);
  must(own != nullptr && LXDefFree(nullptr, own) == 1, "so is one of the default");
  const std::string name = "LX_FUZZ_" + std::to_string(in.below(2));
  setenv("LX_FUZZ_1", content.c_str(), 1);
  const Block<char> value(in.below(50));
  const int32_t needed = LXGetEnv(name.c_str(), value.data(), value.size());
  must(name == "LX_FUZZ_0" ? needed == 0 : needed == static_cast<int32_t>(strlen(content.c_str())) + 1,
       "its bytes");
  for (int32_t selector = 0; selector < 2; ++selector) LXGetDataLocation(value.data(), value.size(), selector);
}

}  // namespace

FUZZ_TARGET(file) {
  open_directory();
  const char* version = nullptr;
  must(LXVersion(&version) == LX_VERSION_NUMBER && strcmp(version, LX_VERSION) == 0,
       "the headers' own library");
  must(*LXGetErrorText(in.integer()) != '\0', "every code has a text");
  blocks(in);
  const std::string path = in.bytes(400);
  divide(path.c_str());
  compare(path, in.bytes(40));
  read_file(in, in.bytes(100));
}

}  // namespace lx::fuzz::file
