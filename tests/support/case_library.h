// The library over a scratch directory that has what text cases need: a small codepage of every kind with case
// and width tables, languages with special mappings and with kana in their names, and a sort.
#pragma once

#include <string>
#include <vector>

#include "source_model.h"
#include "support/forms.h"
#include "support/sort_builder.h"
#include "support/tiny_codepages.h"

namespace lx::test {

/// SINGLE, SJIS, EUC, FOUR, SHIFT, UTF8; K930, which is EBCDIC with small letters of its own, and ODD, which is
/// SJIS where "!" has a "half-width" form of two bytes.
const std::vector<TinyCodepage>& case_codepages();
const TinyCodepage& case_codepage(const std::string& name);

/// The line feed, the carriage return and the two further line ends of one of these codepages.
Units line_ends(const TinyCodepage& cp);

/// The source of the language Special.
const lexicor_data::LanguageSource& special_language();

TestWeight letter(uint16_t primary, uint8_t secondary = 1, uint8_t tertiary = 1,
                  uint8_t char_class = kAppendAll);
TestWeight special(uint16_t weight);
/// a to c, A above a on the tertiary level, an acute accent, a hyphen that is special, "ch" after c, ae as an
/// expansion, digits that insert on the lower levels, and z, y and U+51xx that insert primaries.
SortBuilder example_sort();
/// The same, but that nothing inserts, and with x, which is as "ch".
SortBuilder sort_without_insertion();

/// Languages: English, and Special, Kana and Long of support/locale; there is also the territory Elsewhere, 276. The
/// sorts are called Test and Steady.
class CaseLibrary : public TinyLibrary {
 public:
  explicit CaseLibrary(const SortBuilder& sort = example_sort());
};

}  // namespace lx::test
