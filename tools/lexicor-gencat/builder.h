// The catalog that sources are merged into, one behind the other: sets, messages, their symbolic names, and
// what contradicts what.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "catalog_file.h"
#include "encoding.h"
#include "problems.h"

namespace lexicor_gencat {

/// Brings texts from the codepage of a source to that of the catalog. Characters of a source in the catalog's
/// own codepage keep their bytes.
class Recoder {
 public:
  Recoder(const Encoding& source, const Encoding& target)
      : source_(source), target_(target), same_(source.codepage().name() == target.codepage().name()) {}

  const Encoding& source() const { return source_; }
  const Encoding& target() const { return target_; }

  /// Appends a character; one that the catalog's codepage lacks is an error.
  void put(TextWriter& text, const Character& character, const Place& place, Problems& problems) const;
  /// Appends the character of a Unicode value, for escapes.
  void put_unicode(TextWriter& text, uint32_t unicode, const Place& place, Problems& problems) const;

 private:
  const Encoding& source_;
  const Encoding& target_;
  bool same_;
};

/// One define of the header file.
struct Symbol {
  std::string name;
  uint32_t number;
  Place place;
};

class CatalogBuilder {
 public:
  /// Begins with what a catalog holds already. `default_set` of the X/Open format is 1.
  CatalogBuilder(Catalog existing, Problems& problems);

  /// A source's first line: the default set is the current one, and numbers may be given anew.
  void begin_source();
  void select_set(uint32_t number);
  void select_named_set(const std::string& name, const Place& place);
  void delete_set(uint32_t number);
  void delete_named_set(const std::string& name, const Place& place);

  void put(uint32_t number, std::string text, const Place& place);
  void put_named(const std::string& name, std::string text, const Place& place);
  void remove(uint32_t number);

  Catalog take();
  /// Sets and messages that have names, by ascending numbers.
  std::vector<Symbol> symbols() const;

 private:
  static constexpr uint32_t kDefaultSet = 1;

  struct Message {
    std::string text;
    Place place;       // where the current source defines it; line 0: it does not
    std::string name;  // its number was given to this name
    Place name_place;
  };
  struct Set {
    std::map<uint32_t, Message> messages;
    std::map<std::string, uint32_t> numbers;  // of the messages that have names
    uint32_t last = 0;                        // the highest number that sources use
    std::string name;
    Place name_place;
    bool named = false;  // by the current source
  };

  Set& current() { return sets_[current_]; }
  void store(Set& set, uint32_t number, Message message);

  Problems& problems_;
  Catalog catalog_;  // locale and byte order
  std::map<uint32_t, Set> sets_;
  uint32_t current_ = kDefaultSet;
  uint32_t last_set_ = 0;  // the highest number that a $set gave
};

}  // namespace lexicor_gencat
