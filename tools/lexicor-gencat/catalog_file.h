// A message catalog in memory, and its file: what the compiler writes and what the dumper and a merge read.
#pragma once

#include <cstdint>
#include <map>
#include <string>

#include "core/lxcatformat.h"

namespace lexicor_gencat {

/// The values are the byte-order codes of the header.
enum class ByteOrder : uint32_t {
  kBig = lx::format::catalog::kBigEndian,
  kLittle = lx::format::catalog::kLittleEndian
};

ByteOrder native_byte_order();

struct Catalog {
  std::string locale;
  ByteOrder byte_order = native_byte_order();
  /// Texts by set and number, in the codepage of the locale, without the null that ends each in the file.
  std::map<uint32_t, std::map<uint32_t, std::string>> sets;
};

/// The file: the header, all set records, all indexes, then the texts, in ascending order of their numbers and
/// without gaps. Sets without messages are left out; of a catalog without any, set 1 is written without
/// messages, since a file has one set at least. Throws a Failure when the file would pass 2 GiB.
std::string pack_catalog(const Catalog& catalog);

/// Reads a file of either byte order and any layout; sets without messages are left out. Throws a Failure that
/// says at which offset it is damaged, and how.
Catalog unpack_catalog(const std::string& bytes, const std::string& file_name);

}  // namespace lexicor_gencat
