#include "root_import.h"

#include <unicode/uchar.h>
#include <unicode/unorm2.h>
#include <unicode/uscript.h>

#include <map>
#include <set>
#include <stdexcept>

#include "sort_collator.h"

namespace lexicor_import {
namespace {

using namespace lexicor_data;
using Text = std::u16string;

// Pages with characters that the codepages of 2026 write, and U+1E00 to 1EFF, a page of letters with accents. The list
// is fixed: a further codepage is to change no sort.
constexpr SortRange kTables[] = {{0x0000, 0x06FF}, {0x0900, 0x09FF}, {0x0E00, 0x0FFF}, {0x1100, 0x11FF},
                                 {0x1800, 0x18FF}, {0x1E00, 0x27FF}, {0x2900, 0x29FF}, {0x2E00, 0x33FF},
                                 {0xF900, 0xFBFF}, {0xFE00, 0xFFFF}};
constexpr SortRange kIdeographs[] = {{0x4E00, 0x9FFF}, {0x3400, 0x4DBF}};
constexpr SortRange kSyllables = {0xAC00, 0xD7FF};
constexpr SortRange kComputed[] = {{0xA000, 0xA4FF}, {0xE000, 0xF8FF}};  ///< Yi and private use
constexpr SortRange kSurrogates = {0xD800, 0xDFFF};

/// Groups that have no script, as a character that begins each stands behind this one in ICU's contractions.
constexpr char16_t kGroupMark = 0xFDD1;
constexpr struct {
  char16_t sample;
  const char* name;
} kKinds[] = {
    {0x00A0, "space"}, {0x201C, "punct"}, {0x263A, "symbol"}, {0x20AC, "currency"}, {0x0034, "digit"}};

class Importer {
 public:
  SortRoot run() {
    for (const SortRange& pages : kTables) {
      for (unsigned page = pages.first >> 8; page <= pages.last >> 8; ++page) root_.tables.set(page);
    }
    root_.ideographs.assign(std::begin(kIdeographs), std::end(kIdeographs));
    root_.syllables = {kSyllables};
    root_.computed.assign(std::begin(kComputed), std::end(kComputed));
    root_.uncovered = {kSurrogates};
    find_ideographs();
    find_characters();
    number();
    find_groups();
    find_canonical();
    root_.settle();
    return std::move(root_);
  }

 private:
  using Form = std::pair<uint32_t, unsigned>;  ///< ICU's tertiary weight and case

  void find_ideographs() {
    constexpr UChar32 kFirst = 0x3400, kEnd = 0x40000;
    for (UChar32 code = kFirst; code < kEnd; ++code) {
      if (!u_hasBinaryProperty(code, UCHAR_UNIFIED_IDEOGRAPH)) continue;
      Text text;
      if (!U_IS_BMP(code)) text += U16_LEAD(code);
      text += static_cast<char16_t>(U_IS_BMP(code) ? code : U16_TRAIL(code));
      const std::vector<Ce> elements = collator_.elements(text);
      if (elements.size() != 1) throw std::runtime_error("an ideograph is no single element");
      ideographs_.emplace(elements[0].primary, kFirstIdeograph + static_cast<uint32_t>(code));
    }
  }

  void find_characters() {
    for (unsigned code = 0; code < 0xFFFE; ++code) {
      const auto unit = static_cast<char16_t>(code);
      if (u_charType(unit) == U_UNASSIGNED || root_.is_computed(code)) continue;
      root_.listed.set(code);
      texts_.emplace(Text(1, unit), collator_.elements(Text(1, unit)));
    }
    for (const Text& text : collator_.contractions()) {
      if (text[0] == kGroupMark - 1) continue;  // of ICU's own, for indexes
      bool whole = true;
      for (char16_t unit : text) whole = whole && root_.listed[unit];
      if (whole) texts_.emplace(text, collator_.elements(text));
    }
    for (const auto& entry : texts_) {
      for (const Ce& ce : entry.second) {
        if (ce.primary >= ideographs_.begin()->first)
          ideographs_.emplace(ce.primary, kFirstBehind + entry.first[0]);
        else if (ce.primary != 0)
          primaries_[ce.primary];
        if (ce.secondary != 0) secondaries_[ce.secondary];
        if (ce.tertiary != 0) tertiaries_[{ce.tertiary, ce.letter_case}];
      }
    }
  }

  void number() {
    uint32_t next = 1;
    for (auto& entry : primaries_) entry.second = next++;
    next = kCommonSecondary;
    for (auto& entry : secondaries_) entry.second = next++;
    const auto common = tertiaries_.find({Collator::kCommonTertiary, 0});
    next = kCommonTertiary - static_cast<uint32_t>(std::distance(tertiaries_.begin(), common));
    for (auto& [form, number] : tertiaries_) {
      number = next++;
      if (form.second != 0) root_.upper_tertiaries.set(number);
    }
    for (const auto& [text, elements] : texts_) {
      CollationElements list;
      for (const Ce& ce : elements) list.push_back(element_of(ce));
      if (text.size() == 1)
        root_.characters[text[0]] = std::move(list);
      else
        root_.contractions.emplace(text, std::move(list));
    }
  }

  CollationElement element_of(const Ce& ce) {
    CollationElement element;
    const auto ideograph = ideographs_.find(ce.primary);
    if (ideograph != ideographs_.end())
      element.primary = ideograph->second;
    else if (ce.primary != 0)
      element.primary = primaries_.at(ce.primary);
    if (ce.secondary != 0) element.secondary = secondaries_.at(ce.secondary);
    if (ce.tertiary != 0) element.tertiary = tertiaries_.at({ce.tertiary, ce.letter_case});
    if (collator_.is_variable(ce.primary)) root_.last_variable = std::max(root_.last_variable, element.primary);
    return element;
  }

  /// Where a group begins, among the primary weights that there are.
  void find_groups() {
    std::map<uint32_t, std::string> starts;  // by ICU's weight
    for (const auto& kind : kKinds) starts.emplace(start_of({kGroupMark, kind.sample}), kind.name);
    for (const Text& text : collator_.contractions()) {
      if (text[0] != kGroupMark) continue;
      const bool pair = text.size() == 3;
      const UChar32 sample = pair ? U16_GET_SUPPLEMENTARY(text[1], text[2]) : text[1];
      UErrorCode error = U_ZERO_ERROR;
      const UScriptCode script = uscript_getScript(sample, &error);
      require(error, "uscript_getScript");
      if (script != USCRIPT_COMMON && script != USCRIPT_HIRAGANA && script != USCRIPT_UNKNOWN)
        starts.emplace(start_of(text), uscript_getShortName(script));
    }
    for (const auto& [weight, name] : starts) {
      const auto found = primaries_.lower_bound(weight);
      const uint32_t first =
          found == primaries_.end() ? static_cast<uint32_t>(primaries_.size()) + 1 : found->second;
      // A group without characters of 16 bits begins where the next one does, and counts as none.
      if (!root_.groups.empty() && root_.groups.back().first == first) root_.groups.pop_back();
      root_.groups.push_back({name, first});
    }
  }

  uint32_t start_of(const Text& text) const {
    const std::vector<Ce> elements = collator_.elements(text);
    if (elements.size() != 1) throw std::runtime_error("the begin of a group is no single element");
    return elements[0].primary;
  }

  void find_canonical() {
    UErrorCode error = U_ZERO_ERROR;
    const UNormalizer2* form = unorm2_getNFDInstance(&error);
    require(error, "unorm2_getNFDInstance");
    for (unsigned code = 0; code < 0xFFFE; ++code) {
      const auto unit = static_cast<char16_t>(code);
      if (U16_IS_SURROGATE(unit) || kSyllables.holds(code)) continue;
      root_.combining_class[code] = u_getCombiningClass(unit);
      const Text text(1, unit);
      const Text apart = icu_text("unorm2_normalize", [&](UChar* out, int32_t room, UErrorCode* status) {
        return unorm2_normalize(form, text.data(), 1, out, room, status);
      });
      bool wide = false;
      for (char16_t part : apart) wide = wide || U16_IS_SURROGATE(part);
      if (apart != text && !wide) root_.decompositions.emplace(unit, apart);
    }
  }

  Collator collator_;
  SortRoot root_;
  std::map<uint32_t, uint32_t> ideographs_;  ///< their weights, and those of what is behind them, by ICU's
  std::map<Text, std::vector<Ce>> texts_;
  std::map<uint32_t, uint32_t> primaries_, secondaries_;
  std::map<Form, uint32_t> tertiaries_;
};

}  // namespace

SortRoot import_root() {
  return Importer().run();
}

}  // namespace lexicor_import
