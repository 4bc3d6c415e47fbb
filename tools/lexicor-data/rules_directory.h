// A locale directory for a moment: that of a base directory with the sort of a user's rules beside its own.
#pragma once

#include <cstdint>
#include <string>

namespace lexicor_data {

class RulesDirectory {
 public:
  /// Throws SourceError, or what the file system throws.
  RulesDirectory(const std::string& base, const std::string& rules_file);
  ~RulesDirectory();
  RulesDirectory(const RulesDirectory&) = delete;
  RulesDirectory& operator=(const RulesDirectory&) = delete;

  const std::string& path() const { return path_; }
  uint16_t sort_id() const { return sort_id_; }

 private:
  void remove();

  std::string path_;
  uint16_t sort_id_ = 0;
};

}  // namespace lexicor_data
