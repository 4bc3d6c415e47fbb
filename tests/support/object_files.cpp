#include "support/object_files.h"

#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>

#include "core/lxbytes.h"
#include "core/lxformat.h"

namespace lx::test {
namespace {

ByteString copy(Bytes bytes) {
  return ByteString(bytes.data, bytes.data + bytes.size);
}

}  // namespace

ByteString object_file(const std::vector<ByteString>& sections, uint32_t version) {
  ByteString file(format::kHeaderBytes);
  format::Header header;
  header.format = version << format::Header::kVersionShift;
  header.sections = static_cast<uint16_t>(sections.size());
  for (size_t i = 0; i < sections.size(); ++i) {
    header.section[i] = {static_cast<uint16_t>(sections[i].size()), static_cast<uint32_t>(file.size())};
    file.insert(file.end(), sections[i].begin(), sections[i].end());
  }
  header.write(file.data());
  return file;
}

ByteString control_file(const std::vector<ControlRecord>& records) {
  ByteString table(records.size() * format::ControlRecord::kBytes);
  for (size_t i = 0; i < records.size(); ++i) {
    format::ControlRecord record{records[i].id, records[i].type};
    records[i].name.copy(record.name, sizeof(record.name));
    record.write(table.data() + i * record.kBytes);
  }
  return object_file({table});
}

ScratchDirectory::ScratchDirectory() {
  std::string pattern = (std::filesystem::temp_directory_path() / "lexicor-test-XXXXXX").string();
  if (mkdtemp(pattern.data()) == nullptr) throw std::runtime_error("no temporary directory");
  path_ = pattern;
}

ScratchDirectory::~ScratchDirectory() {
  std::error_code ignored;
  std::filesystem::remove_all(path_, ignored);
}

void ScratchDirectory::write(const std::string& name, const ByteString& content) const {
  std::ofstream out(file(name), std::ios::binary);
  out.write(reinterpret_cast<const char*>(content.data()), static_cast<std::streamsize>(content.size()));
  if (!out.flush()) throw std::runtime_error("cannot write " + name);
}

void ScratchDirectory::write_text(const std::string& name, const std::string& content) const {
  write(name, ByteString(content.begin(), content.end()));
}

ByteString ScratchDirectory::read(const std::string& name) const {
  std::ifstream in(file(name), std::ios::binary);
  return ByteString(std::istreambuf_iterator<char>(in), {});
}

bool ScratchDirectory::exists(const std::string& name) const {
  return access(file(name).c_str(), F_OK) == 0;
}

void ScratchDirectory::write_locale(const std::vector<Codepage>& codepages) const {
  ByteString language = copy(kBuiltInLanguage.sections.section[0]);
  put_le16(language.data() + 2 * format::language::kDefaultTerritory, 840);
  if (!codepages.empty())
    put_le16(language.data() + 2 * format::language::kDefaultCodepage, codepages.front().id);
  write("la_00001.nls", object_file({language}));
  write("te_00840.nls", object_file({copy(kBuiltInTerritory.sections.section[0])}));
  std::vector<ControlRecord> records{{1, 0, "English"}, {840, 1, "UnitedStates"}};
  for (const Codepage& codepage : codepages) {
    char name[32];
    snprintf(name, sizeof(name), "cp_%05d.nls", codepage.id);
    write(name, object_file(codepage.sections, codepage.version));
    records.push_back({codepage.id, 2, codepage.name});
  }
  write("control.nls", control_file(records));
}

std::vector<ByteString> ascii_codepage() {
  const Sections& built_in = kBuiltInCodepage.sections;
  return {copy(built_in.section[0]), {}, copy(built_in.section[2])};
}

}  // namespace lx::test
