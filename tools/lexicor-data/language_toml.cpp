// Reading, writing, packing and unpacking of a language.
#include "language_toml.h"

#include <strings.h>

#include <algorithm>
#include <ostream>

#include "payload_texts.h"
#include "toml_text.h"

namespace lexicor_data {
namespace {

namespace lang = lx::format::language;

constexpr char kBinary[] = "Binary";

/// The words of the single texts and of the first of each list.
enum TextWord : size_t {
  kAbbreviation = lang::kFirstText,
  kName = 6,
  kDays = 7,
  kShortDays = 14,
  kMonths = 21,
  kShortMonths = 34,
  kMorning = 47,
  kAfternoon = 48,
};

std::string narrow(const std::u16string& text) {
  std::string out;
  for (char16_t unit : text) out += unit < 0x80 ? static_cast<char>(unit) : '?';
  return out;
}

/// The identifier of an object that a language names by default.
uint16_t read_default(TomlTable& defaults, const std::string& key, ObjectType type, const Control& control) {
  const toml::node& at = defaults.node(key);
  const bool may_be_none = type == ObjectType::kSort;
  if (at.is_integer()) {
    const uint16_t id = defaults.number(key, 65535);
    if (!(may_be_none && id == 0) && control.find(type, id) == nullptr) {
      defaults.fail(at, "no " + key + " has the identifier " + std::to_string(id));
    }
    return id;
  }
  const std::string name = narrow(defaults.text(key));
  if (may_be_none && strcasecmp(name.c_str(), kBinary) == 0) return 0;
  const ObjectName* object = control.find(type, name);
  if (object == nullptr) defaults.fail(at, "no " + key + " has the name " + name);
  return object->id;
}

std::vector<SpecialMapping> read_specials(TomlTable& root, const std::string& key) {
  std::vector<SpecialMapping> specials;
  if (!root.has(key)) return specials;
  for (TomlTable& entry : root.tables(key)) {
    SpecialMapping special;
    entry.allow({"from", "to"});
    auto read = [&](const char* name, char16_t(&units)[2]) {
      const std::u16string text = entry.text(name);
      entry.reading(name, [&] {
        const toml::node& at = entry.node(name);
        if (at.is_string() && (text.empty() || text.size() > 2))
          entry.fail(at, "expected one or two characters");
        std::copy_n(text.begin(), std::min<size_t>(text.size(), 2), units);
        return true;
      });
    };
    read("from", special.from);
    read("to", special.to);
    specials.push_back(special);
  }
  return specials;
}

void write_specials(std::ostream& out, const char* key, const std::vector<SpecialMapping>& specials) {
  if (specials.empty()) return;
  auto text = [](const char16_t(&units)[2]) {
    return toml_quote(std::u16string(units, units[1] == 0 ? 1 : 2));
  };
  out << key << " = [\n";
  for (const SpecialMapping& special : specials) {
    out << "  { from = " << text(special.from) << ", to = " << text(special.to) << " },\n";
  }
  out << "]\n";
}

std::string default_text(const Control* control, ObjectType type, uint16_t id) {
  if (type == ObjectType::kSort && id == 0) return std::string("\"") + kBinary + '"';
  const ObjectName* object = control == nullptr ? nullptr : control->find(type, id);
  if (object == nullptr) return std::to_string(id);
  return toml_quote(std::u16string(object->name.begin(), object->name.end()));
}

void append_specials(ByteVector& payload, size_t count_word, size_t offset_word,
                     const std::vector<SpecialMapping>& specials) {
  put_word(payload, count_word, specials.size());
  put_word(payload, offset_word, payload.size());
  for (const SpecialMapping& special : specials) {
    append_record(payload,
                  lang::SpecialMapping{special.from[0], special.from[1], special.to[0], special.to[1]});
  }
}

std::vector<SpecialMapping> specials_at(const ByteVector& payload, size_t count_word, size_t offset_word) {
  std::vector<SpecialMapping> specials(word_at(payload, count_word));
  size_t at = word_at(payload, offset_word);
  for (SpecialMapping& special : specials) {
    const auto record = record_at<lang::SpecialMapping>(payload, at);
    special = {{record.first, record.second}, {record.result1, record.result2}};
    at += record.kBytes;
  }
  return specials;
}

/// The number of months to write: a 13th that is empty is not named.
size_t month_count(const std::array<std::u16string, 13>& months) {
  return months[12].empty() ? 12 : 13;
}

}  // namespace

LanguageSource read_language(std::istream& in, const std::string& file_name, const Control& control) {
  const toml::table parsed = parse_toml(in, file_name);
  SourceErrors errors;
  TomlTable root(parsed, file_name, &errors);
  root.allow({"abbreviation", "name", "default", "days", "short_days", "months", "short_months", "morning",
              "afternoon", "special_upper", "special_lower"});
  LanguageSource language;
  language.abbreviation = root.text("abbreviation");
  language.name = root.text("name");
  TomlTable defaults = root.table("default");
  defaults.allow({"territory", "codepage", "sort"});
  auto default_of = [&](ObjectType type) {
    const std::string key = kTypeNames[static_cast<size_t>(type)];
    return defaults.reading(key, [&] { return read_default(defaults, key, type, control); });
  };
  language.territory = default_of(ObjectType::kTerritory);
  language.codepage = default_of(ObjectType::kCodepage);
  language.sort = default_of(ObjectType::kSort);
  auto read_list = [&](const char* key, auto& list, size_t fewest) {
    const auto texts = root.texts(key, fewest, list.size());
    std::copy(texts.begin(), texts.end(), list.begin());
  };
  read_list("days", language.days, 7);
  read_list("short_days", language.short_days, 7);
  read_list("months", language.months, 12);
  read_list("short_months", language.short_months, 12);
  language.morning = root.text("morning");
  language.afternoon = root.text("afternoon");
  language.special_upper = read_specials(root, "special_upper");
  language.special_lower = read_specials(root, "special_lower");
  errors.sort(file_name);
  errors.throw_if_any();
  return language;
}

void write_language(std::ostream& out, const LanguageSource& language, const Control* control) {
  out << "abbreviation = " << toml_quote(language.abbreviation) << '\n'
      << "name = " << toml_quote(language.name) << '\n'
      << "default = { territory = " << default_text(control, ObjectType::kTerritory, language.territory)
      << ", codepage = " << default_text(control, ObjectType::kCodepage, language.codepage)
      << ", sort = " << default_text(control, ObjectType::kSort, language.sort) << " }\n"
      << "days = " << toml_list(language.days.data(), 7) << '\n'
      << "short_days = " << toml_list(language.short_days.data(), 7) << '\n'
      << "months = " << toml_list(language.months.data(), month_count(language.months)) << '\n'
      << "short_months = " << toml_list(language.short_months.data(), month_count(language.short_months))
      << '\n'
      << "morning = " << toml_quote(language.morning) << '\n'
      << "afternoon = " << toml_quote(language.afternoon) << '\n';
  write_specials(out, "special_upper", language.special_upper);
  write_specials(out, "special_lower", language.special_lower);
}

ByteVector pack_language(const LanguageSource& language, const std::string& file_name) {
  ByteVector payload(lang::kHeaderBytes);
  put_word(payload, lang::kDefaultTerritory, language.territory);
  put_word(payload, lang::kDefaultCodepage, language.codepage);
  put_word(payload, lang::kDefaultSort, language.sort);
  auto append_list = [&](size_t word, const auto& list) {
    for (const std::u16string& text : list) append_text(payload, word++, text);
  };
  append_text(payload, kAbbreviation, language.abbreviation);
  append_text(payload, kName, language.name);
  append_list(kDays, language.days);
  append_list(kShortDays, language.short_days);
  append_list(kMonths, language.months);
  append_list(kShortMonths, language.short_months);
  append_text(payload, kMorning, language.morning);
  append_text(payload, kAfternoon, language.afternoon);
  append_specials(payload, lang::kUpperSpecials, lang::kUpperSpecialTable, language.special_upper);
  append_specials(payload, lang::kLowerSpecials, lang::kLowerSpecialTable, language.special_lower);
  require_payload_fits(payload, file_name);
  return payload;
}

LanguageSource unpack_language(const ByteVector& payload) {
  LanguageSource language;
  language.territory = word_at(payload, lang::kDefaultTerritory);
  language.codepage = word_at(payload, lang::kDefaultCodepage);
  language.sort = word_at(payload, lang::kDefaultSort);
  auto read_list = [&](size_t word, auto& list) {
    for (std::u16string& text : list) text = text_at(payload, word++);
  };
  language.abbreviation = text_at(payload, kAbbreviation);
  language.name = text_at(payload, kName);
  read_list(kDays, language.days);
  read_list(kShortDays, language.short_days);
  read_list(kMonths, language.months);
  read_list(kShortMonths, language.short_months);
  language.morning = text_at(payload, kMorning);
  language.afternoon = text_at(payload, kAfternoon);
  language.special_upper = specials_at(payload, lang::kUpperSpecials, lang::kUpperSpecialTable);
  language.special_lower = specials_at(payload, lang::kLowerSpecials, lang::kLowerSpecialTable);
  return language;
}

}  // namespace lexicor_data
