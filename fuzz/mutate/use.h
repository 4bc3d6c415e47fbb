// Everything that reads a file of the directory, through the public interface, with texts and outputs in blocks of
// their exact sizes, so that the address sanitizer sees what goes beyond them.
#pragma once

#include <memory>
#include <random>
#include <stdexcept>
#include <string>

#include "small_files.h"
#include "support/forms.h"

namespace mutate {

using Random = std::minstd_rand;

inline void must(bool holds, const char* rule) {
  if (!holds) throw std::logic_error(rule);
}

/// A block of exactly so many units.
template <class Unit>
class Exact {
 public:
  explicit Exact(size_t units) : units_(units), block_(new Unit[units]()) {}
  explicit Exact(const lx::test::Text<Unit>& text) : Exact(text.size()) {
    std::copy(text.begin(), text.end(), block_.get());
  }
  Unit* data() const { return block_.get(); }
  int32_t size() const { return static_cast<int32_t>(units_); }

 private:
  size_t units_;
  std::unique_ptr<Unit[]> block_;
};

/// Initialises the library on the directory, uses the file and what depends on it, and ends. Throws where a result
/// cannot be, a block or a descriptor is lost.
void use_directory(const lx::test::ScratchDirectory& directory, const SmallFiles& files, const SmallFile& file,
                   uint32_t seed);

/// Strings, comparison, collation, mapping, conversion, numbers, times, items, streams and line ends, in all four
/// forms or in one of them. `other` is a second locale to convert to.
void use_texts(LXLocale* locale, LXLocale* other, Random& random, bool all_forms);

}  // namespace mutate
