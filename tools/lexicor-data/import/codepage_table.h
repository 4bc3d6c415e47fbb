// The list of the locale directory's codepages and where each comes from.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace lexicor_import {

enum Origin {
  kIcu,      ///< a converter of ICU
  kGlibc,    ///< an iconv module of glibc, for tables that ICU does not have
  kComputed  ///< no table; ICU's converter gives the aliases
};

struct Codepage {
  const char* name;
  uint16_t id;
  Origin origin;
  const char* table;
  const char* overrides;  ///< blank-separated
  const char* aliases;    ///< blank-separated
};

/// A codepage whose source says what differs from that of another one.
struct Sibling {
  const char* name;
  const char* base;
};

/// Every codepage, by ascending identifier.
std::vector<Codepage> all_codepages();

/// The words of a blank-separated list.
std::vector<std::string> words(const std::string& text);

}  // namespace lexicor_import
