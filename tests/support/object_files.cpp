#include "support/object_files.h"

#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>

#include "compile.h"
#include "control_source.h"
#include "core/lxformat.h"
#include "object_file.h"

namespace lx::test {
namespace {

ByteString copy(Bytes bytes) {
  return ByteString(bytes.data, bytes.data + bytes.size);
}

}  // namespace

ByteString object_file(const std::vector<ByteString>& sections, uint32_t version) {
  return lexicor_data::write_object({sections, version, ""});
}

ByteString control_file(const std::vector<ControlRecord>& records) {
  lexicor_data::Control control;
  for (const ControlRecord& r : records)
    control.objects.push_back({static_cast<lexicor_data::ObjectType>(r.type), r.id, r.name, 0});
  return object_file({pack_control(control)});
}

std::vector<ByteString> version1_codepage(std::vector<ByteString> sections) {
  namespace cp = format::codepage;
  ByteString& payload = sections[0];
  ByteString& trie = sections[1];
  const auto word = [&](size_t field) { return le16(&payload[field]); };
  if (payload[cp::kWidth] > 1) {
    constexpr size_t kMoved = cp::kFixedBytes - cp::in_version1(cp::kFixedBytes);
    for (size_t field : {cp::kFullWidth, cp::kPairs, cp::kTypeTrie, cp::kTypeRecords})
      if (word(field) != 0) put_le16(&payload[field], static_cast<uint16_t>(word(field) - kMoved));
    ByteString nodes;
    for (size_t at = 0; at + cp::UnicodeNode::kBytes <= word(cp::kUnicodeValues);
         at += cp::UnicodeNode::kBytes) {
      const auto node = cp::UnicodeNode::read(&trie[at]);
      lexicor_data::append_record(nodes, cp::TypeNode{node.leaf, node.mask, node.base});
    }
    trie.erase(trie.begin(), trie.begin() + word(cp::kUnicodeValues));
    put_le16(&payload[cp::kUnicodeValues], static_cast<uint16_t>(nodes.size()));
    trie.insert(trie.begin(), nodes.begin(), nodes.end());
  }
  payload.erase(payload.begin() + cp::kTypes - 2, payload.begin() + cp::kTypes);
  payload.erase(payload.begin() + cp::kShiftOut, payload.begin() + cp::kLengths);
  return sections;
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

void ScratchDirectory::write_locale(const std::vector<Codepage>& codepages, std::vector<Object> others) const {
  const auto order = [](const ControlRecord& r) { return std::pair(r.type, r.id); };
  std::vector<ControlRecord> records;
  const auto add = [&](const ControlRecord& record, const ByteString& content) {
    write(
        lexicor_data::object_file_name({static_cast<lexicor_data::ObjectType>(record.type), record.id, "", 0}),
        content);
    records.push_back(record);
  };
  for (const Codepage& codepage : codepages)
    add({codepage.id, LX_CODEPAGE, codepage.name}, object_file(codepage.sections, codepage.version));
  ByteString language = payload_of(kBuiltInLanguage);
  put_le16(language.data() + 2 * format::language::kDefaultTerritory, 840);
  if (!codepages.empty()) {
    const auto first = std::min_element(codepages.begin(), codepages.end(),
                                        [](const auto& a, const auto& b) { return a.id < b.id; });
    put_le16(language.data() + 2 * format::language::kDefaultCodepage, first->id);
  }
  others.push_back({{1, LX_LANGUAGE, "English"}, language});
  others.push_back({{840, LX_TERRITORY, "UnitedStates"}, payload_of(kBuiltInTerritory)});
  for (const Object& object : others) add(object.record, object_file({object.payload}));
  std::sort(records.begin(), records.end(),
            [&](const ControlRecord& a, const ControlRecord& b) { return order(a) < order(b); });
  write("control.nls", control_file(records));
}

std::vector<ByteString> ascii_codepage() {
  const Sections& built_in = kBuiltInCodepage.sections;
  return {copy(built_in.section[0]), {}, copy(built_in.section[2])};
}
ByteString payload_of(const BuiltIn& object) {
  return copy(object.sections.section[0]);
}

}  // namespace lx::test
