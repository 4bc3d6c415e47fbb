#include "sort_import.h"

#include <unicode/ucol.h>
#include <unicode/ures.h>

#include <map>
#include <set>
#include <sstream>
#include <stdexcept>

#include "icu_text.h"
#include "sort_line.h"
#include "sort_rules.h"
#include "sort_tailoring.h"

namespace lexicor_import {
namespace {

using namespace lexicor_data;
using Kind = SortRule::Kind;

std::string utf8_rules(const UChar* rules, int32_t length) {
  std::string text;
  for (int32_t i = 0; i < length; ++i) {
    const char16_t unit = rules[i];
    if (U16_IS_LEAD(unit) &&
        i + 1 < length) {  // a character that no sort has: read as a private one, and left out
      text += utf8_text(u"\uE000");
      ++i;
    } else {
      text += utf8_text({&unit, 1});
    }
  }
  return text;
}

/// CLDR's rules for a locale.
std::vector<SortRule> rules_of(const char* locale) {
  UErrorCode error = U_ZERO_ERROR;
  const IcuPtr<UCollator, ucol_close> collator(ucol_open(locale, &error));
  require(error, "ucol_open");
  if (error == U_USING_DEFAULT_WARNING && std::string(locale) != "root")
    throw std::runtime_error(std::string("no collator for ") + locale);
  int32_t length = 0;
  const UChar* rules = ucol_getRules(collator.get(), &length);
  return read_rules(utf8_rules(rules, length), std::string("CLDR ") + locale);
}

/// What [import LOCALE-u-co-TYPE] names.
std::vector<SortRule> imported_rules(const std::string& name) {
  const std::string mark = "-u-co-";
  const size_t at = name.find(mark);
  if (at == std::string::npos) throw std::runtime_error("cannot import " + name);
  const std::string locale = name.substr(0, at), type = name.substr(at + mark.size());
  UErrorCode error = U_ZERO_ERROR;
  const std::string bundle = std::string("icudt") + U_ICU_VERSION_SHORT + "l-coll";
  using Bundle = IcuPtr<UResourceBundle, ures_close>;
  const Bundle file(ures_open(bundle.c_str(), locale.c_str(), &error));
  const Bundle collations(ures_getByKey(file.get(), "collations", nullptr, &error));
  const Bundle collation(ures_getByKey(collations.get(), type.c_str(), nullptr, &error));
  int32_t length = 0;
  const UChar* rules = ures_getStringByKey(collation.get(), "Sequence", &length, &error);
  require(error, name.c_str());
  return read_rules(utf8_rules(rules, length), "CLDR " + name);
}

class Filter {
 public:
  Filter(const SortRoot& root, const SortTailoring& tables, Notes& notes)
      : root_(root), common_(tables), tables_(tables.tables()), notes_(notes) {}

  std::vector<SortRule> run(const std::vector<SortRule>& rules) {
    std::vector<SortRule> kept;
    keep(rules, kept);
    drop_empty_reset(kept);
    for (const auto& [reason, texts] : left_out_) {
      std::string line = "left out, " + reason + " (" + std::to_string(texts.size()) + "):";
      constexpr size_t kMost = 400;
      for (size_t i = 0; i < texts.size() && i < kMost; ++i)
        line += (i == 0 ? " " : ", ") + code_points_text(texts[i]);
      notes_.push_back(line + (texts.size() > kMost ? ", ..." : ""));
    }
    return kept;
  }

 private:
  void keep(const std::vector<SortRule>& rules, std::vector<SortRule>& kept) {
    for (const SortRule& rule : rules) {
      if (rule.kind == Kind::kSetting)
        keep_setting(rule, kept);
      else if (rule.kind == Kind::kReset)
        keep_reset(rule, kept);
      else
        keep_relation(rule, kept);
    }
  }

  void keep_setting(const SortRule& rule, std::vector<SortRule>& kept) {
    const std::string& name = rule.words[0].text;
    // What a sort does anyway, and ICU's own business.
    static const std::set<std::string> usual = {"alternate", "normalization", "strength"};
    if (usual.count(name) != 0) return;
    if (name == "import") return keep(imported_rules(rule.words[1].text), kept);
    SortRule setting = rule;
    if (name == "reorder") cut_reorder(setting);
    if (name == "reorder" && setting.words.size() == 1) return;
    kept.push_back(setting);
  }

  void cut_reorder(SortRule& rule) {
    std::vector<SortWord> words;
    std::string left_out;
    for (const SortWord& word : rule.words) {
      if (&word == &rule.words.front() || has_table(word.text))
        words.push_back(word);
      else
        left_out += ' ' + word.text;
    }
    if (!left_out.empty()) notes_.push_back("left out of [reorder], without a table:" + left_out);
    rule.words = words;
  }

  bool has_table(const std::string& script) const {
    const auto found = std::find_if(root_.groups.begin(), root_.groups.end(),
                                    [&](const SortGroup& g) { return g.name == script; });
    if (found == root_.groups.end()) throw std::runtime_error("no group " + script);
    if (script == "Hani") return true;
    const uint32_t end = found + 1 == root_.groups.end() ? UINT32_MAX : (found + 1)->first;
    for (unsigned code = 0; code < kCharacters; ++code) {
      const CollationElements& elements = root_.characters[code];
      if (!elements.empty() && elements[0].primary >= found->first && elements[0].primary < end &&
          tables_[code >> 8])
        return true;
    }
    return false;
  }

  static void drop_empty_reset(std::vector<SortRule>& kept) {
    while (!kept.empty() && kept.back().kind == Kind::kReset) kept.pop_back();
  }

  void keep_reset(const SortRule& rule, std::vector<SortRule>& kept) {
    drop_empty_reset(kept);
    kept.push_back(rule);
    dropped_ = Strength::kNone;
    const CollationElements elements = common_.elements(rule.text);
    letters_ = std::count_if(elements.begin(), elements.end(),
                             [](const CollationElement& element) { return element.primary != 0; });
  }

  void keep_relation(const SortRule& rule, std::vector<SortRule>& kept) {
    const std::string reason = reason_against(rule);
    if (!reason.empty()) {
      left_out_[reason].push_back(rule.before + rule.text);
      if (dropped_ == Strength::kNone || rule.strength < dropped_) dropped_ = rule.strength;
      return;
    }
    kept.push_back(rule);
    // What follows a relation that is left out stands at its place, and differs from what is before by as much.
    if (dropped_ != Strength::kNone && rule.strength > dropped_) kept.back().strength = dropped_;
    dropped_ = Strength::kNone;
    // A difference on the fourth level is none in a sort.
    if (kept.back().strength == Strength::kQuaternary) kept.back().strength = Strength::kIdentical;
  }

  std::string reason_against(const SortRule& rule) const {
    if (!rule.before.empty()) return "depends on the character before";
    if (rule.text.size() > 2) return "contraction of more than two characters";
    if (rule.text.size() == 2 && letters_ > 1) return "contraction with more than one element";
    for (const char16_t unit : rule.text) {
      if (root_.is_ideograph(unit)) return "ideograph";
      if (!tables_[unit >> 8] || !root_.listed[unit]) return "without a table";
    }
    return "";
  }

  const SortRoot& root_;
  const SortTailoring& common_;
  const std::bitset<256> tables_;
  Notes& notes_;
  std::ptrdiff_t letters_ = 0;          ///< of the last reset
  Strength dropped_ = Strength::kNone;  ///< the greatest difference of what was left out behind a reset
  std::map<std::string, std::vector<std::u16string>> left_out_;
};

RuleFile no_rules(const std::string&) {
  return {};
}

}  // namespace

std::string import_rules(const Sort& sort, const SortRoot& root, Notes& notes) {
  const std::string mark = LEXICOR_INSTEAD;
  std::string own = sort.rules;
  const bool instead = own.compare(0, mark.size(), mark) == 0;
  if (instead) own.erase(0, mark.size());
  if (!own.empty()) own += '\n';
  std::ostringstream out;
  if (!instead) {
    SortTailoring tables(root, no_rules);
    tables.apply({std::string(sort.name) + ".rules", own});
    write_rules(out, Filter(root, tables, notes).run(rules_of(sort.locale)));
  }
  const std::string imported = out.str();
  return imported + (imported.empty() || own.empty() ? "" : "\n") + own;
}

}  // namespace lexicor_import
