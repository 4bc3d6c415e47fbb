// The table: one piece of work a row, done by the library and by each peer that can do it. A row is checked and
// measured when it is added, and printed at once.
#pragma once

#include <cstddef>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace bench {

/// Short texts and values of a row. They stay in the second-level cache; of a few hundred a processor would know by heart
/// which way each branch goes.
inline constexpr size_t kManyPieces = 10000;

/// Does the work of a row once. Gives the bytes that it wrote to `output`, or a number that says what it found.
using Work = std::function<size_t(char* output)>;

struct Peer {
  const char* name;      // kOurs first
  Work work;             // empty: this one cannot
  bool is_rival = true;  // must give the same, and can be ahead
};
inline constexpr const char* kOurs = "lexicor";
inline constexpr const char* kWrapped = "lexicor.hpp";
inline constexpr const char* kIcu = "icu";
inline constexpr const char* kGlibc = "glibc";
inline constexpr const char* kIconv = "iconv";
inline constexpr const char* kUnistring = "libunistring";

/// What must be the same in all peers.
enum class Same {
  kBytes,    // what is written
  kNumber,   // what is given back
  kNothing,  // the row has seen to it
};

/// The first rival that does not give what the first one of all gives, with `room` bytes for each output; null
/// when all do, and the front one itself when it gives nothing.
const Peer* differing(const std::vector<Peer>& peers, size_t room, Same same);

struct Row {
  std::string name;  // family/.../size
  std::vector<Peer> peers;
  size_t chars;  // in the input of one pass
  size_t calls;  // in one pass
  size_t room;   // bytes that an output can take
  Same same = Same::kBytes;
};

/// The least of several turns.
struct Measured {
  const char* peer;
  double ns;  // processor time of a pass
  bool is_rival;
};

struct TableOptions {
  std::vector<std::string> rows;  // parts of names, of which one must be in a row's name; none: all rows
  bool markdown = false;
  int turns = 11;
  double turn_milliseconds = 2;
};

class Table {
 public:
  explicit Table(TableOptions options) : options_(std::move(options)) {}

  /// Whether a row of this name is to be measured.
  bool wants(const std::string& name) const;
  /// Whether a row can be whose name begins with this.
  bool wants_some(const std::string& beginning) const;
  /// Passes over a row without a rival. Ends the program when a rival does not give what the first one gives.
  void add(const Row& row);
  /// Prints a row that was measured elsewhere, the first of `peers` ours, as `chars` characters in `calls`
  /// calls. `note` stands behind the peers.
  void print(const std::string& name, const std::vector<Measured>& peers, size_t chars, size_t calls,
             const std::string& note = "");
  /// The time of a pass of one peer alone.
  double least_ns(const Work& work) const;
  /// Prints a row of a call whose time grows with its text of `chars` characters to this power.
  void print_growth(const std::string& name, double ns, size_t chars, double exponent);
  /// The last line: how many rows are behind a peer, miss their goal, or grow faster than their text.
  void print_sum() const;

 private:
  void print_head();
  void print_cells(const std::string& name, double ns, size_t chars, size_t calls, const std::string& peer,
                   const std::string& goal, const std::string& mark, const std::string& others);

  TableOptions options_;
  bool has_head_ = false;
  int rows_ = 0, behind_ = 0, missed_ = 0, steep_ = 0;
};

/// How many times our time the fastest peer is to take, at least; 0 where a row has no goal.
double goal_of(const std::string& row);

/// A text in pieces of one call each, one behind the other in one buffer.
struct Pieces {
  std::string bytes;
  std::vector<size_t> ends;
  size_t chars = 0;
};
using Input = std::shared_ptr<const Pieces>;

/// The work of calling `step(input, bytes, output)`, which gives the bytes written, for every piece; each
/// writes behind the one before it.
template <class Step>
Work for_each_piece(const Input& input, Step step) {
  return [input, step](char* output) {
    const char* const bytes = input->bytes.data();
    char* out = output;
    size_t start = 0;
    for (const size_t end : input->ends) {
      out += step(bytes + start, end - start, out);
      start = end;
    }
    return static_cast<size_t>(out - output);
  };
}

/// As for_each_piece of a step that gives a number: the sum.
template <class Step>
Work sum_of_pieces(const Input& input, Step step) {
  return [input, step](char*) {
    const char* const bytes = input->bytes.data();
    size_t start = 0, sum = 0;
    for (const size_t end : input->ends) {
      sum += step(bytes + start, end - start);
      start = end;
    }
    return sum;
  };
}

/// The lengths and counts of the libraries.
inline int32_t length(size_t n) {
  return static_cast<int32_t>(n);
}
inline size_t count(int32_t n) {
  return n > 0 ? static_cast<size_t>(n) : 0;
}

}  // namespace bench
