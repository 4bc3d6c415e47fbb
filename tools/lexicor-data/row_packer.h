// Packs rows of elements into one array: equal rows are stored once, a row that already stands somewhere is
// reused, and a row's start overlaps the array's end where they agree. The array only grows, so rows may be
// added in turns (the rows of a trie's inner nodes depend on where the rows below them went).
#pragma once

#include <algorithm>
#include <cstddef>
#include <numeric>
#include <utility>
#include <vector>

namespace lexicor_data {

template <typename Element>
class RowPacker {
 public:
  using Row = std::vector<Element>;

  /// A row, never empty, and the index that a look-up computes for its first element: it stands at that
  /// position at the earliest, so that position minus index is a base of 0 or more.
  struct Request {
    Row row;
    size_t first_index = 0;
  };

  /// `filler` stands where no row reaches.
  explicit RowPacker(Element filler, Row initial = {}) : filler_(filler), pool_(std::move(initial)) {}

  /// Places the rows and returns the position of each.
  std::vector<size_t> place(const std::vector<Request>& requests);

  /// Makes positions below `size` valid.
  void reserve(size_t size) {
    if (pool_.size() < size) pool_.resize(size, filler_);
  }

  const Row& pool() const { return pool_; }

 private:
  struct Pending {
    size_t request;
    std::vector<size_t> borders;  ///< for each prefix, its longest proper prefix that is also its suffix
    size_t overlap = 0;           ///< elements at the array's end that are the row's start
  };

  static std::vector<size_t> borders_of(const Row& row);
  bool find(const Request& request, size_t from, Pending& pending, size_t& position) const;

  Element filler_;
  Row pool_;
};

template <typename Element>
std::vector<size_t> RowPacker<Element>::borders_of(const Row& row) {
  std::vector<size_t> borders(row.size() + 1, 0);
  for (size_t i = 1, length = 0; i < row.size(); ++i) {
    while (length > 0 && row[i] != row[length]) length = borders[length];
    if (row[i] == row[length]) ++length;
    borders[i + 1] = length;
  }
  return borders;
}

/// Goes on from `from` to the array's end (Knuth, Morris and Pratt); true if the whole row stands there.
template <typename Element>
bool RowPacker<Element>::find(const Request& request, size_t from, Pending& pending, size_t& position) const {
  const Row& row = request.row;
  size_t length = pending.overlap;
  for (size_t i = std::max(from, request.first_index); i < pool_.size(); ++i) {
    while (length > 0 && pool_[i] != row[length]) length = pending.borders[length];
    if (pool_[i] == row[length]) ++length;
    if (length == row.size()) {
      position = i + 1 - length;
      return true;
    }
  }
  pending.overlap = length;
  return false;
}

template <typename Element>
std::vector<size_t> RowPacker<Element>::place(const std::vector<Request>& requests) {
  // Longest first, so that shorter rows find themselves in longer ones.
  std::vector<Pending> pending;
  for (size_t i = 0; i < requests.size(); ++i) pending.push_back({i, borders_of(requests[i].row), 0});
  std::sort(pending.begin(), pending.end(), [&](const Pending& a, const Pending& b) {
    const Request &x = requests[a.request], &y = requests[b.request];
    if (x.row.size() != y.row.size()) return x.row.size() > y.row.size();
    if (x.row != y.row) return x.row < y.row;
    return x.first_index != y.first_index ? x.first_index > y.first_index : a.request < b.request;
  });

  std::vector<size_t> position(requests.size());
  size_t grown_from = 0;  // the array up to here was searched for every pending row
  while (!pending.empty()) {
    // Most rows do not begin in the new part of the array: they need not be searched for.
    Row grown(pool_.begin() + static_cast<std::ptrdiff_t>(grown_from), pool_.end());
    std::sort(grown.begin(), grown.end());
    // One pass drops the rows that the array now holds and finds the row to go on with: one that needs no
    // padding before it, with the longest overlap; the first of the order among equals.
    size_t best = 0, best_overlap = 0, best_padding = 0, kept = 0;
    for (size_t i = 0; i < pending.size(); ++i) {
      const Request& request = requests[pending[i].request];
      const bool may_stand =
          pending[i].overlap != 0 || std::binary_search(grown.begin(), grown.end(), request.row[0]);
      if (may_stand && find(request, grown_from, pending[i], position[pending[i].request])) continue;
      const size_t overlap = pending[i].overlap;
      const size_t padding = request.first_index > pool_.size() ? request.first_index - pool_.size() : 0;
      if (kept == 0 || (padding != best_padding ? padding < best_padding : overlap > best_overlap)) {
        best = kept, best_overlap = overlap, best_padding = padding;
      }
      if (kept != i) pending[kept] = std::move(pending[i]);
      ++kept;
    }
    pending.erase(pending.begin() + static_cast<std::ptrdiff_t>(kept), pending.end());
    if (pending.empty()) break;

    const size_t chosen = pending[best].request;
    const Row& row = requests[chosen].row;
    grown_from = pool_.size();
    reserve(requests[chosen].first_index);
    position[chosen] = pool_.size() - best_overlap;
    pool_.insert(pool_.end(), row.begin() + static_cast<std::ptrdiff_t>(best_overlap), row.end());
    pending.erase(pending.begin() + static_cast<std::ptrdiff_t>(best));
  }
  return position;
}

}  // namespace lexicor_data
