// The library over a scratch directory that has what text cases need: a small codepage of every kind with case
// and width tables, languages with special mappings and with kana in their names, and a sort.
#pragma once

#include <string>
#include <vector>

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

struct SpecialMapping {
  uint16_t first, second, result1, result2;  // second and result2 0 for none
};
/// Of the language Special. U+2603 is in UTF8 alone.
const std::vector<SpecialMapping>& upper_specials();
const std::vector<SpecialMapping>& lower_specials();

TestWeight letter(uint16_t primary, uint8_t secondary = 1, uint8_t tertiary = 1,
                  uint8_t char_class = kAppendAll);
TestWeight special(uint16_t weight);
/// a to c, A above a on the tertiary level, an acute accent, a hyphen that is special, "ch" after c, ae as an
/// expansion, digits that insert on the lower levels, and z, y and U+51xx that insert primaries.
SortBuilder example_sort();

/// Languages: English; Special; Kana, whose names begin with kana; Long, whose days run together besides, and
/// which says AM in the afternoon. The territory Elsewhere, 276, has other separators, one of which is no ASCII,
/// and a kana for a currency. The sort is called Test.
class CaseLibrary : public TinyLibrary {
 public:
  explicit CaseLibrary(const SortBuilder& sort = example_sort());
};

}  // namespace lx::test
