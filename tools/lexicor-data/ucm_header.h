// The header of a codepage table: its keys, and what stands for those that are missing.
#pragma once

#include <map>
#include <string>
#include <vector>

#include "codepage_defaults.h"
#include "ucm.h"
#include "ucm_line.h"
#include "ucm_states.h"

namespace lexicor_data {

class UcmHeader {
 public:
  UcmHeader(const std::string& file, CodepageSource& source) : file_(file), source_(source) {}

  /// Reads a line with a key.
  void read_key(UcmLine& line);
  /// The header ends here: where an error about a key that is not there is said to be.
  void end(Position here) { end_ = here; }

  const std::string& base() const { return base_; }
  Position place_of(const char* key) const;
  /// What the base says holds where the file says nothing.
  void take_from(const CodepageSource& base);
  /// Gives the keys that are missing what follows from the mappings, then checks all of them.
  void settle(SourceErrors& errors);

  [[noreturn]] void fail(const char* key, const std::string& what) const;

 private:
  bool has(const char* key) const { return keys_.count(key) != 0; }
  void refuse_or_pass_over(const std::string& key, Position start);
  void warn(Position where, const std::string& what);
  void read_value(UcmLine& line, const std::string& key);
  void read_class(UcmLine& line);
  void read_substitution(UcmLine& line);
  void read_yes_or_no(UcmLine& line);
  void read_leads(UcmLine& line);
  void settle_class();
  void settle_leads();
  void settle_substitution(const ByteOf& byte_of);
  void check_width() const;
  void check_single(const char* key, uint8_t byte) const;

  const std::string& file_;
  CodepageSource& source_;
  Position end_;
  std::map<std::string, Position> keys_;
  std::string base_;
  UcmStates states_;
  std::string family_;  ///< <icu:charsetFamily>
  size_t substitution_bytes_ = 1;
  bool leads_of_base_ = false;
  bool says_width_ = true;             ///< itself, not its base
  int substitution_of_one_byte_ = -1;  ///< <subchar1>
};

}  // namespace lexicor_data
