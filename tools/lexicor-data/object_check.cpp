// The library's validator first; behind it everything lies inside its section, so the rest reads freely.
#include "object_check.h"

#include <vector>

#include "core/lxformat.h"
#include "core/lxobjtypes.h"
#include "payload_texts.h"
#include "ucm.h"

namespace lexicor_data {
namespace {

namespace format = lx::format;
namespace cp = lx::format::codepage;

class Check {
 public:
  Check(const ObjectFile& object, const ObjectName& name, const std::string& file_name)
      : object_(object), payload_(object.sections[0]), name_(name), file_name_(file_name) {}

  void run() const {
    check_container();
    check_sound();
    switch (name_.type) {
      case ObjectType::kLanguage:
        return check_texts(format::language::kHeaderBytes, format::language::kFirstText,
                           format::language::kLastText);
      case ObjectType::kTerritory:
        return check_territory();
      case ObjectType::kCodepage:
        return check_codepage();
      case ObjectType::kSort:
        return check_sort();
    }
  }

 private:
  [[noreturn]] void fail(const std::string& what) const { throw SourceError(file_name_, 0, 0, what); }
  size_t value(size_t field) const { return lx::le16(&payload_[field]); }

  void check_container() const {
    if (object_.version != format::kFormatVersion)
      fail("the format version is " + std::to_string(object_.version) + ", not 2");
    if (name_.type != ObjectType::kCodepage && object_.sections.size() != 1)
      fail("there is more than one section");
  }

  void check_sound() const {
    const ValidatorInUse validator;
    lx::Sections sections;
    for (size_t i = 0; i < object_.sections.size(); ++i)
      sections.section[i] = {object_.sections[i].data(), object_.sections[i].size()};
    const lx::Fault fault = lx::kObjectTypes[static_cast<size_t>(name_.type)]->validate(name_.id, sections);
    if (fault.code == LX_E_MEMORY) fail("there is no memory for the check");
    if (fault)
      fail("section " + std::to_string(fault.section) + ", offset " + std::to_string(fault.offset) + ": " +
           fault.reason);
  }

  /// Texts stand behind the words, in their order.
  void check_texts(size_t header_bytes, size_t first, size_t last) const {
    for (size_t i = first; i <= last; ++i) {
      const std::string text = "the text of word " + std::to_string(i);
      if (word_at(payload_, i) < header_bytes) fail(text + " begins inside the header");
      if (i > first && word_at(payload_, i) < word_at(payload_, i - 1))
        fail(text + " stands before the one before");
    }
  }

  void check_territory() const {
    namespace terr = format::territory;
    check_texts(terr::kHeaderBytes, terr::kFirstText, terr::kLastText);
    if (word_at(payload_, terr::kPayloadBytes) != payload_.size()) fail("word 22 is not the payload's size");
    const size_t positions = word_at(payload_, terr::kSignPositions);
    if ((positions & 0xFF) > 4 || positions >> 8 > 4) fail("a sign position is above 4");
  }

  void check_codepage() const {
    const uint8_t width = payload_[cp::kWidth];
    for (unsigned byte = 0; (value(cp::kFlags) & cp::kFlagShift) != 0 && byte < 256; ++byte)
      if (payload_[cp::kLengths + byte] != 1)
        fail("byte " + std::to_string(byte) + " of a codepage with shift states is longer than 1");
    if (name_.id == cp::kUtf8Id && object_.sections.size() > 1)
      fail("the identifier " + std::to_string(cp::kUtf8Id) + " is that of UTF-8, which has no tables");
    if (width == 1) return;
    for (size_t field : {cp::kFullWidth, cp::kPairs, cp::kTypeTrie, cp::kTypeRecords})
      if (value(field) < cp::kFixedBytes || value(field) % 4 != 0)
        fail("the offset at " + std::to_string(field) + " is not a multiple of 4 behind the fixed part");
    const auto pair = [&](size_t i) {
      return record_at<cp::WidthPair>(payload_, value(cp::kPairs) + i * cp::WidthPair::kBytes);
    };
    for (size_t i = 1; i < value(cp::kPairCount); ++i)
      if (pair(i).half <= pair(i - 1).half) fail("the width pairs are not sorted");
  }

  /// Tables stand behind the fixed part and are sorted, and no expansion is missing.
  void check_sort() const {
    namespace sort = format::sort;
    const size_t expansions = value(sort::kExpansionCount);
    const size_t contractions = value(sort::kContractionCount);
    if ((expansions != 0 && value(sort::kExpansions) < sort::kFixedBytes) ||
        (contractions != 0 && value(sort::kContractions) < sort::kFixedBytes))
      fail("expansions or contractions lie inside the fixed part");
    std::vector<bool> expands(0x10000);
    uint32_t last = 0;
    for (size_t i = 0; i < expansions; ++i) {
      const size_t at = value(sort::kExpansions) + i * sort::Expansion::kBytes;
      const uint32_t character = record_at<sort::Expansion>(payload_, at).character;
      if (i > 0 && character <= last) fail("the expansions are not sorted");
      expands[last = character] = true;
    }
    for (size_t i = 0; i < contractions; ++i) {
      const size_t at = value(sort::kContractions) + i * sort::Contraction::kBytes;
      const auto record = record_at<sort::Contraction>(payload_, at);
      const uint32_t characters = uint32_t{record.first} << 16 | record.second;
      if (i > 0 && characters <= last) fail("the contractions are not sorted");
      last = characters;
    }
    for (size_t number = 0; number < 256; ++number) check_sort_page(number, expands);
  }

  void check_sort_page(size_t number, const std::vector<bool>& expands) const {
    namespace sort = format::sort;
    const auto page = record_at<sort::Page>(payload_, sort::kPages + number * sort::Page::kBytes);
    if (!page.is_table()) return;
    if (value(sort::kWeights) < sort::kFixedBytes)
      fail("the weights of page " + std::to_string(number) + " lie inside the fixed part");
    for (size_t low = 0; low < 256; ++low) {
      const size_t at = value(sort::kWeights) + (page.base + low) * sort::WeightRecord::kBytes;
      const size_t character = number << 8 | low;
      if (record_at<sort::WeightRecord>(payload_, at).is_expansion() && !expands[character])
        fail("character " + std::to_string(character) + " has no expansion");
    }
  }

  const ObjectFile& object_;
  const ByteVector& payload_;
  const ObjectName& name_;
  const std::string& file_name_;
};

}  // namespace

ValidatorInUse::ValidatorInUse() {
  LXInit("", nullptr, nullptr, nullptr, LX_NO_DEFAULTS);
}

ValidatorInUse::~ValidatorInUse() {
  LXTerm();
}

void check_object(const ObjectFile& object, const ObjectName& name, const std::string& file_name) {
  Check(object, name, file_name).run();
}

}  // namespace lexicor_data
