// What is known of an object's data: their digest, and from the directory's manifest what they were made from.
#pragma once

#include <string>

#include "report.h"

namespace lexicor_cli {

class Provenance {
 public:
  /// Reads the manifest of the directory in use; without one, as without a directory, nothing is known.
  Provenance();

  /// The digest in hexadecimal of an object's data, and what they were made from; null where it is not known. Binary
  /// order has the digest of zeros.
  Json digest_of(int type, const std::string& name) const;
  Json source_of(int type, const std::string& name) const;
  /// The version of the compiler's output.
  Json compiler() const;

 private:
  Json field_of(int type, const std::string& name, const char* field) const;

  Json manifest_;
};

}  // namespace lexicor_cli
