// The rows of the table: one conversion of one text, with each library that can do it.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "codepages.h"

namespace bench {

/// A text in pieces that are converted one by one, one behind the other in one buffer.
struct Pieces {
  std::string bytes;
  std::vector<size_t> ends;
  size_t chars = 0;
};

struct Peer {
  const char* name;                  // kOurs, kIcu, kIconv, kMemcpy
  std::function<size_t(char*)> run;  // converts all pieces into a buffer: the bytes written
};
inline constexpr const char* kOurs = "lexicor";
inline constexpr const char* kIcu = "icu";
inline constexpr const char* kIconv = "iconv";
inline constexpr const char* kMemcpy = "memcpy";

struct Row {
  std::string name;  // codepage/text/direction/size
  std::shared_ptr<const Pieces> input;
  std::vector<Peer> peers;
  size_t output_bytes;
};

/// All rows whose name contains `filter`. Ends the program when the libraries do not convert a text to the same
/// bytes.
std::vector<Row> make_rows(const std::vector<std::unique_ptr<Codepage>>& codepages, const std::string& filter);

}  // namespace bench
