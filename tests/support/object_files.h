// Locale directories made by a test: a temporary directory with a control file and object files of any content.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "core/lxobjtypes.h"
#include "locale/lxlocale.h"

namespace lx::test {

using ByteString = std::vector<uint8_t>;

/// An object or control file: header and up to four sections, sections[0] being the payload.
ByteString object_file(const std::vector<ByteString>& sections, uint32_t version = 2);

struct ControlRecord {
  uint16_t id;
  uint8_t type;
  std::string name;
};
ByteString control_file(const std::vector<ControlRecord>& records);

/// A temporary directory, removed with everything in it at the end.
class ScratchDirectory {
 public:
  ScratchDirectory();
  ~ScratchDirectory();
  ScratchDirectory(const ScratchDirectory&) = delete;
  ScratchDirectory& operator=(const ScratchDirectory&) = delete;

  const std::string& path() const { return path_; }
  std::string file(const std::string& name) const { return path_ + "/" + name; }
  void write(const std::string& name, const ByteString& content) const;
  void write_text(const std::string& name, const std::string& content) const;
  ByteString read(const std::string& name) const;
  bool exists(const std::string& name) const;

  /// Writes English 1, UnitedStates 840 (their payloads are the built-in ones, with the language's defaults
  /// pointing at 840 and at the codepage of the lowest identifier), the codepages and other objects given, and
  /// the control file.
  struct Codepage {
    uint16_t id;
    std::string name;
    std::vector<ByteString> sections;
    uint32_t version = 2;
  };
  struct Object {
    ControlRecord record;
    ByteString payload;
  };
  void write_locale(const std::vector<Codepage>& codepages, std::vector<Object> others = {}) const;

 private:
  std::string path_;
};

ByteString payload_of(const BuiltIn& object);

/// Payload and low array of a single-byte codepage that is US-ASCII in its first half; a base to change in
/// tests.
std::vector<ByteString> ascii_codepage();

/// A codepage in the form of version 1, which lacks the shift bytes, two unused ones, and the ranges of nodes.
std::vector<ByteString> version1_codepage(std::vector<ByteString> sections);

}  // namespace lx::test
