// A table of plain records that grows without copying where the system can move its pages.
#pragma once

#include <cstddef>
#include <cstdlib>
#include <new>
#include <type_traits>

namespace lexicor_cli {

template <class Row>
class Rows {
  static_assert(std::is_trivially_copyable_v<Row>, "rows are moved as bytes");

 public:
  Rows() = default;
  ~Rows() { std::free(rows_); }
  Rows(const Rows&) = delete;
  Rows& operator=(const Rows&) = delete;

  void push_back(const Row& row) {
    if (size_ == room_) grow();
    rows_[size_++] = row;
  }
  /// Adds rows that are still to be written.
  void add(size_t count) {
    while (room_ - size_ < count) grow();
    size_ += count;
  }
  /// Forgets the rows, and keeps their room.
  void clear() { size_ = 0; }

  size_t size() const { return size_; }
  /// The memory of the rows, in bytes.
  size_t bytes() const { return size_ * sizeof(Row); }
  Row& operator[](size_t i) { return rows_[i]; }
  const Row& operator[](size_t i) const { return rows_[i]; }
  Row* begin() { return rows_; }
  Row* end() { return rows_ + size_; }
  const Row* begin() const { return rows_; }
  const Row* end() const { return rows_ + size_; }

 private:
  void grow() {
    const size_t room = room_ == 0 ? 1024 : 2 * room_;
    void* const rows = std::realloc(static_cast<void*>(rows_), room * sizeof(Row));
    if (rows == nullptr) throw std::bad_alloc();
    rows_ = static_cast<Row*>(rows);
    room_ = room;
  }

  Row* rows_ = nullptr;
  size_t size_ = 0, room_ = 0;
};

}  // namespace lexicor_cli
