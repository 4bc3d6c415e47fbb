// The rows of the table: one piece of work on one text, with each library that can do it.
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
  const char* name;                  // kOurs, kWrapped, kIcu, kIconv, kMemcpy
  std::function<size_t(char*)> run;  // does the work on all pieces; into a buffer, where it gives bytes
};
inline constexpr const char* kOurs = "lexicor";
inline constexpr const char* kWrapped = "lexicor.hpp";
inline constexpr const char* kIcu = "icu";
inline constexpr const char* kIconv = "iconv";
inline constexpr const char* kMemcpy = "memcpy";
inline constexpr const char* kGlibc = "glibc";

struct Row {
  std::string name;  // codepage/text/direction/size
  std::shared_ptr<const Pieces> input;
  std::vector<Peer> peers;
  size_t output_room;  // bytes of output that its peers need, or take for granted
};

/// The rows of each family whose name contains `filter`. They end the program when the libraries do not give
/// the same results.
std::vector<Row> make_rows(const std::vector<std::unique_ptr<Codepage>>& codepages, const std::string& filter);

void add_mapping_rows(std::vector<Row>* rows, const std::string& filter);
void add_collation_rows(std::vector<Row>* rows, const std::string& filter);
void add_formatting_rows(std::vector<Row>* rows, const std::string& filter);

}  // namespace bench
