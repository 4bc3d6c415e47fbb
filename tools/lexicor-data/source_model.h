// What the sources of a locale directory say, in memory: the list of objects, languages and territories. The
// codepage has a header of its own (ucm.h).
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "core/lxformat.h"

namespace lexicor_data {

enum class ObjectType : uint8_t { kLanguage, kTerritory, kCodepage, kSort };

/// The word of a type in control.txt, and in messages.
inline constexpr const char* kTypeNames[lx::format::kTypes] = {"language", "territory", "codepage", "sort"};

struct ObjectName {
  ObjectType type = ObjectType::kLanguage;
  uint16_t id = 0;
  std::string name;
  int line = 0;  ///< where control.txt lists it; 0 when read from an object
};

/// The objects of a directory, by ascending type and identifier.
struct Control {
  std::vector<ObjectName> objects;

  const ObjectName* find(ObjectType type, uint16_t id) const;
  const ObjectName* find(ObjectType type, const std::string& name) const;  ///< without regard to case
};

/// One entry of a special case table: a character or a pair becomes one or two characters (0: none).
struct SpecialMapping {
  char16_t from[2] = {0, 0};
  char16_t to[2] = {0, 0};
};

struct LanguageSource {
  uint16_t territory = 0, codepage = 0, sort = 0;  ///< the defaults; sort 0 is binary order
  std::u16string abbreviation, name;
  std::array<std::u16string, 7> days, short_days;
  std::array<std::u16string, 13> months, short_months;  ///< the 13th empty in calendars of twelve
  std::u16string morning, afternoon;
  std::vector<SpecialMapping> special_upper, special_lower;
};

struct TerritorySource {
  std::u16string abbreviation, name;
  std::array<char16_t, 5> separators{};  ///< decimal, thousands, list, monetary decimal, monetary thousands
  std::array<uint16_t, 3> digits{};      ///< fraction digits: number, currency, international
  uint8_t positive_position = 0, negative_position = 0;
  uint16_t value84 = 0;
  std::array<bool, 7> flags{};  ///< by bit: 58, 73, 74, 75, 76, 82, 83
  std::u16string number_grouping, monetary_grouping, currency, international_currency;
  std::u16string positive_sign, negative_sign, time_format, short_date_format, long_date_format;
};

}  // namespace lexicor_data
