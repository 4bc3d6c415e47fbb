// Reading, writing, packing and unpacking of a territory. The layout stands once, in tables of members by key
// and in the order of their words.
#include "territory_toml.h"

#include <ostream>

#include "payload_texts.h"
#include "toml_text.h"

namespace lexicor_data {
namespace {

namespace terr = lx::format::territory;

constexpr uint16_t kHighestPosition = 4;

constexpr const char* kSeparatorKeys[] = {"decimal", "thousands", "list", "monetary_decimal",
                                          "monetary_thousands"};
constexpr const char* kDigitKeys[] = {"number", "currency", "international"};

/// A flag by bit: its table ("" for the root) and key.
struct FlagKey {
  const char* table;
  const char* key;
};
constexpr FlagKey kFlagKeys[] = {
    {"", "flag58"},
    {"placement", "symbol_before_positive"},
    {"placement", "space_in_positive"},
    {"placement", "symbol_before_negative"},
    {"placement", "space_in_negative"},
    {"", "flag82"},
    {"", "flag83"},
};

/// A text by word, from terr::kFirstText on.
struct TextKey {
  const char* table;
  const char* key;
  std::u16string TerritorySource::*member;
};
constexpr TextKey kTextKeys[] = {
    {"", "abbreviation", &TerritorySource::abbreviation},
    {"", "name", &TerritorySource::name},
    {"grouping", "number", &TerritorySource::number_grouping},
    {"grouping", "monetary", &TerritorySource::monetary_grouping},
    {"currency", "symbol", &TerritorySource::currency},
    {"currency", "international", &TerritorySource::international_currency},
    {"signs", "positive", &TerritorySource::positive_sign},
    {"signs", "negative", &TerritorySource::negative_sign},
    {"formats", "time", &TerritorySource::time_format},
    {"formats", "short_date", &TerritorySource::short_date_format},
    {"formats", "long_date", &TerritorySource::long_date_format},
};
static_assert(std::size(kTextKeys) == terr::kLastText - terr::kFirstText + 1);

/// The tables of the source, in the order in which they are written; "" is the root.
constexpr const char* kTables[] = {"",         "separators", "digits",    "grouping",
                                   "currency", "signs",      "placement", "formats"};

bool same(const char* a, const char* b) {
  return std::string(a) == b;
}

/// The keys that a table has.
std::vector<std::string> keys_of(const char* name) {
  std::vector<std::string> keys;
  for (const TextKey& text : kTextKeys) {
    if (same(text.table, name)) keys.push_back(text.key);
  }
  for (const FlagKey& flag : kFlagKeys) {
    if (same(flag.table, name)) keys.push_back(flag.key);
  }
  if (same(name, "")) {
    keys.push_back("value84");
    keys.insert(keys.end(), std::begin(kTables) + 1, std::end(kTables));
  }
  if (same(name, "separators")) keys.insert(keys.end(), std::begin(kSeparatorKeys), std::end(kSeparatorKeys));
  if (same(name, "digits")) keys.insert(keys.end(), std::begin(kDigitKeys), std::end(kDigitKeys));
  if (same(name, "signs")) keys.insert(keys.end(), {"positive_position", "negative_position"});
  return keys;
}

void read_table(TomlTable& table, const char* name, TerritorySource& territory) {
  table.allow(keys_of(name));
  for (const TextKey& text : kTextKeys) {
    if (same(text.table, name)) territory.*text.member = table.text(text.key);
  }
  for (size_t bit = 0; bit < std::size(kFlagKeys); ++bit) {
    if (same(kFlagKeys[bit].table, name)) territory.flags[bit] = table.flag(kFlagKeys[bit].key);
  }
  if (same(name, "")) territory.value84 = table.number("value84", 65535);
  if (same(name, "separators")) {
    for (size_t i = 0; i < territory.separators.size(); ++i) {
      territory.separators[i] = table.character(kSeparatorKeys[i]);
    }
  }
  if (same(name, "digits")) {
    for (size_t i = 0; i < territory.digits.size(); ++i)
      territory.digits[i] = table.number(kDigitKeys[i], 65535);
  }
  if (same(name, "signs")) {
    territory.positive_position = static_cast<uint8_t>(table.number("positive_position", kHighestPosition));
    territory.negative_position = static_cast<uint8_t>(table.number("negative_position", kHighestPosition));
  }
}

}  // namespace

TerritorySource read_territory(std::istream& in, const std::string& file_name) {
  const toml::table parsed = parse_toml(in, file_name);
  SourceErrors errors;
  TomlTable root(parsed, file_name, &errors);
  TerritorySource territory;
  for (const char* name : kTables) {
    if (same(name, "")) {
      read_table(root, name, territory);
      continue;
    }
    TomlTable table = root.table(name);
    read_table(table, name, territory);
  }
  errors.sort(file_name);
  errors.throw_if_any();
  return territory;
}

void write_territory(std::ostream& out, const TerritorySource& territory) {
  for (const char* name : kTables) {
    if (!same(name, "")) out << "\n[" << name << "]\n";
    for (const TextKey& text : kTextKeys) {
      if (same(text.table, name)) out << text.key << " = " << toml_quote(territory.*text.member) << '\n';
    }
    for (size_t bit = 0; bit < std::size(kFlagKeys); ++bit) {
      if (!same(kFlagKeys[bit].table, name)) continue;
      out << kFlagKeys[bit].key << " = " << (territory.flags[bit] ? "true" : "false") << '\n';
    }
    if (same(name, "")) out << "value84 = " << territory.value84 << '\n';
    if (same(name, "separators")) {
      for (size_t i = 0; i < territory.separators.size(); ++i) {
        out << kSeparatorKeys[i] << " = " << toml_quote(std::u16string(1, territory.separators[i])) << '\n';
      }
    }
    if (same(name, "digits")) {
      for (size_t i = 0; i < territory.digits.size(); ++i)
        out << kDigitKeys[i] << " = " << territory.digits[i] << '\n';
    }
    if (same(name, "signs")) {
      out << "positive_position = " << int{territory.positive_position} << '\n'
          << "negative_position = " << int{territory.negative_position} << '\n';
    }
  }
}

ByteVector pack_territory(const TerritorySource& territory, const std::string& file_name) {
  ByteVector payload(terr::kHeaderBytes);
  for (size_t i = 0; i < territory.separators.size(); ++i) {
    put_word(payload, terr::kSeparators + i, territory.separators[i]);
  }
  for (size_t i = 0; i < territory.digits.size(); ++i)
    put_word(payload, terr::kNumbers + i, territory.digits[i]);
  put_word(payload, terr::kSignPositions,
           territory.positive_position | static_cast<unsigned>(territory.negative_position) << 8);
  put_word(payload, terr::kValue84, territory.value84);
  unsigned flags = 0;
  for (size_t bit = 0; bit < territory.flags.size(); ++bit) flags |= territory.flags[bit] ? 1U << bit : 0;
  put_word(payload, terr::kFlags, flags);
  size_t word = terr::kFirstText;
  for (const TextKey& text : kTextKeys) append_text(payload, word++, territory.*text.member);
  require_payload_fits(payload, file_name);
  put_word(payload, terr::kPayloadBytes, payload.size());
  return payload;
}

TerritorySource unpack_territory(const ByteVector& payload) {
  TerritorySource territory;
  for (size_t i = 0; i < territory.separators.size(); ++i) {
    territory.separators[i] = static_cast<char16_t>(word_at(payload, terr::kSeparators + i));
  }
  for (size_t i = 0; i < territory.digits.size(); ++i)
    territory.digits[i] = word_at(payload, terr::kNumbers + i);
  territory.positive_position = static_cast<uint8_t>(word_at(payload, terr::kSignPositions));
  territory.negative_position = static_cast<uint8_t>(word_at(payload, terr::kSignPositions) >> 8);
  territory.value84 = word_at(payload, terr::kValue84);
  for (size_t bit = 0; bit < territory.flags.size(); ++bit) {
    territory.flags[bit] = (word_at(payload, terr::kFlags) >> bit & 1) != 0;
  }
  size_t word = terr::kFirstText;
  for (const TextKey& text : kTextKeys) territory.*text.member = text_at(payload, word++);
  return territory;
}

}  // namespace lexicor_data
