// lexicor info: the items of a locale, as a table or as JSON.
#include <lx.h>

#include <memory>
#include <sstream>

#include "arguments.h"
#include "command.h"
#include "hex.h"
#include "locale.h"
#include "output.h"
#include "provenance.h"
#include "report.h"
#include "session.h"

namespace lexicor_cli {

namespace {

struct InfoOptions {
  std::string name;  // empty: the user's locale
  bool native = false;
  bool json = false;
};

enum class Kind { kNumber, kText };

/// Items one behind the other: the n-th of several has its number behind the name.
struct ItemRange {
  const char* name;
  int32_t first;
  int32_t count;
  Kind kind;
};

constexpr ItemRange kItems[] = {
    {"language_id", LX_ITEM_LANGUAGE_ID, 1, Kind::kNumber},
    {"language", LX_ITEM_LANGUAGE, 1, Kind::kText},
    {"language_abbreviation", LX_ITEM_LANGUAGE_ABBREVIATION, 1, Kind::kText},
    {"language_name", LX_ITEM_LANGUAGE_NAME, 1, Kind::kText},
    {"territory_id", LX_ITEM_TERRITORY_ID, 1, Kind::kNumber},
    {"territory", LX_ITEM_TERRITORY, 1, Kind::kText},
    {"territory_abbreviation", LX_ITEM_TERRITORY_ABBREVIATION, 1, Kind::kText},
    {"territory_name", LX_ITEM_TERRITORY_NAME, 1, Kind::kText},
    {"codepage_id", LX_ITEM_CODEPAGE_ID, 1, Kind::kNumber},
    {"codepage", LX_ITEM_CODEPAGE, 1, Kind::kText},
    {"sort_id", LX_ITEM_SORT_ID, 1, Kind::kNumber},
    {"sort", LX_ITEM_SORT, 1, Kind::kText},
    {"default_territory", LX_ITEM_DEFAULT_TERRITORY, 1, Kind::kText},
    {"default_codepage", LX_ITEM_DEFAULT_CODEPAGE, 1, Kind::kText},
    {"default_sort", LX_ITEM_DEFAULT_SORT, 1, Kind::kText},
    {"day", LX_ITEM_DAY, 7, Kind::kText},
    {"short_day", LX_ITEM_SHORT_DAY, 7, Kind::kText},
    {"month", LX_ITEM_MONTH, 13, Kind::kText},
    {"short_month", LX_ITEM_SHORT_MONTH, 13, Kind::kText},
    {"morning", LX_ITEM_MORNING, 1, Kind::kText},
    {"afternoon", LX_ITEM_AFTERNOON, 1, Kind::kText},
    {"flag_58", LX_ITEM_FLAG_58, 1, Kind::kNumber},
    {"decimal", LX_ITEM_DECIMAL, 1, Kind::kText},
    {"thousands", LX_ITEM_THOUSANDS, 1, Kind::kText},
    {"list", LX_ITEM_LIST, 1, Kind::kText},
    {"grouping", LX_ITEM_GROUPING, 1, Kind::kText},
    {"digits", LX_ITEM_DIGITS, 1, Kind::kNumber},
    {"currency", LX_ITEM_CURRENCY, 1, Kind::kText},
    {"international_currency", LX_ITEM_INTERNATIONAL_CURRENCY, 1, Kind::kText},
    {"monetary_decimal", LX_ITEM_MONETARY_DECIMAL, 1, Kind::kText},
    {"monetary_thousands", LX_ITEM_MONETARY_THOUSANDS, 1, Kind::kText},
    {"monetary_grouping", LX_ITEM_MONETARY_GROUPING, 1, Kind::kText},
    {"currency_digits", LX_ITEM_CURRENCY_DIGITS, 1, Kind::kNumber},
    {"international_digits", LX_ITEM_INTERNATIONAL_DIGITS, 1, Kind::kNumber},
    {"positive_sign", LX_ITEM_POSITIVE_SIGN, 1, Kind::kText},
    {"negative_sign", LX_ITEM_NEGATIVE_SIGN, 1, Kind::kText},
    {"positive_precedes", LX_ITEM_POSITIVE_PRECEDES, 1, Kind::kNumber},
    {"positive_space", LX_ITEM_POSITIVE_SPACE, 1, Kind::kNumber},
    {"negative_precedes", LX_ITEM_NEGATIVE_PRECEDES, 1, Kind::kNumber},
    {"negative_space", LX_ITEM_NEGATIVE_SPACE, 1, Kind::kNumber},
    {"positive_position", LX_ITEM_POSITIVE_POSITION, 1, Kind::kNumber},
    {"negative_position", LX_ITEM_NEGATIVE_POSITION, 1, Kind::kNumber},
    {"time_format", LX_ITEM_TIME_FORMAT, 1, Kind::kText},
    {"short_date_format", LX_ITEM_SHORT_DATE_FORMAT, 1, Kind::kText},
    {"long_date_format", LX_ITEM_LONG_DATE_FORMAT, 1, Kind::kText},
    {"flag_82", LX_ITEM_FLAG_82, 1, Kind::kNumber},
    {"flag_83", LX_ITEM_FLAG_83, 1, Kind::kNumber},
    {"value_84", LX_ITEM_VALUE_84, 1, Kind::kNumber},
    {"codepage_width", LX_ITEM_CODEPAGE_WIDTH, 1, Kind::kNumber},
    {"codepage_ascii", LX_ITEM_CODEPAGE_ASCII, 1, Kind::kNumber},
    {"codepage_shift", LX_ITEM_CODEPAGE_SHIFT, 1, Kind::kNumber},
    {"locale_string", LX_ITEM_LOCALE_STRING, 1, Kind::kText},
};

constexpr size_t kNumberChars = 2;
constexpr size_t kNameChars = 22;  // of the longest name

Json value_of(LXLocale* locale, Kind kind, int32_t item) {
  if (kind == Kind::kNumber) {
    const std::optional<int32_t> number = number_item(locale, item);
    return number ? Json(*number) : Json();
  }
  const std::optional<std::string> text = text_item(locale, item);
  return text ? Json(*text) : Json();
}

/// A text in quotes, so that blanks and empty texts are seen.
std::string readable(const Json& value) {
  return value.is_null() ? "(not in the locale directory)"
                         : value.dump(-1, ' ', false, Json::error_handler_t::replace);
}

/// The objects of a locale: by type, what item names them.
constexpr struct {
  const char* type;
  int32_t name_item;
} kObjects[] = {{"language", LX_ITEM_LANGUAGE},
                {"territory", LX_ITEM_TERRITORY},
                {"codepage", LX_ITEM_CODEPAGE},
                {"sort", LX_ITEM_SORT}};

/// The digest of the data that the library uses, in hexadecimal.
Json digest_of(LXLocale* locale, int32_t type) {
  uint8_t digest[LX_DIGEST_BYTES];
  if (LXGetLocaleDigest(locale, type, digest, sizeof digest) == 0) return Json();
  std::string text;
  for (const uint8_t byte : digest) text += hex_text(byte, 2);
  for (char& c : text) c = c >= 'A' ? static_cast<char>(c - 'A' + 'a') : c;
  return text;
}

/// What the locale's objects were made from; a manifest that tells of other data says nothing of these.
Json objects_of(LXLocale* locale) {
  const Provenance provenance;
  Json rows = Json::array();
  for (int32_t type = LX_LANGUAGE; type <= LX_SORT; ++type) {
    const std::string name = text_item(locale, kObjects[type].name_item).value_or("");
    const Json digest = digest_of(locale, type);
    const Json source = digest == provenance.digest_of(type, name) ? provenance.source_of(type, name) : Json();
    rows.push_back({{"type", kObjects[type].type},
                    {"name", name},
                    {"digest", digest},
                    {"made_from", source},
                    {"compiler", source.is_null() ? Json() : provenance.compiler()}});
  }
  return rows;
}

std::string info_text(LXLocale* locale, bool json) {
  std::ostringstream out;
  Json rows = Json::array();
  for (const ItemRange& range : kItems) {
    for (int32_t i = 0; i < range.count; ++i) {
      const int32_t item = range.first + i;
      const std::string name = range.name + (range.count > 1 ? "_" + std::to_string(i + 1) : "");
      const Json value = value_of(locale, range.kind, item);
      if (json)
        rows.push_back({{"item", item}, {"name", name}, {"value", value}});
      else
        out << padded(std::to_string(item), kNumberChars, Align::kRight) << "  " << padded(name, kNameChars)
            << "  " << readable(value) << '\n';
    }
  }
  const Json objects = objects_of(locale);
  if (json) return json_text({{"items", rows}, {"objects", objects}});
  for (const Json& object : objects) {
    const std::string type = object["type"].get<std::string>();
    for (const char* field : {"digest", "made_from"})
      if (!object[field].is_null())
        out << std::string(kNumberChars + 2, ' ') << padded(type + '_' + field, kNameChars) << "  "
            << readable(object[field]) << '\n';
  }
  return out.str();
}

int info(const InfoOptions& options, const CommonOptions& common) {
  const Session session(common);
  const LocalePtr locale = options.native ? open_native_locale(options.name) : open_chosen_locale(options.name);
  Output output;
  output.write(info_text(locale.get(), options.json));
  return kDone;
}

}  // namespace

Run declare_info(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<InfoOptions>();
  const Arguments::Option name =
      command
          .add_option("LOCALE", options->name, "LANGUAGE[_TERRITORY][.CODEPAGE][@SORT]; else the user's locale")
          .type_name("");
  command
      .add_flag("--native", options->native, "LOCALE is a name of the operating system, with its conventions")
      .needs(name);
  command.add_flag("--json", options->json, "print JSON");
  command.footer(
      "Each line has the number, the name and the value of an item; texts stand in quotes.\n"
      "\n"
      "Examples:\n"
      "  lexicor info German_Austria\n"
      "  lexicor info --native de_AT.utf8 --json");
  return [options, &common] { return info(*options, common); };
}

}  // namespace lexicor_cli
