// What the operating system's names of locales stand for: the table of names, and the search in it.
#include <cstdio>
#include <cstring>

#include "core/lxtrace.h"
#include "lx.h"

using namespace lx;

namespace {

RAS1_Unit unit = RAS1_UNIT("lxnativemap");

/// One form of a family: what follows the base name, and the codepage that it means.
struct Form {
  const char* suffix;
  const char* codepage;
};

constexpr size_t kMostForms = 3;

/// The names that one language and territory has. Names are searched family by family, form by form.
struct Family {
  const char* base;
  const char* language;
  const char* territory;
  const char* sort;
  Form forms[kMostForms];
};

constexpr Form kUtf8{".utf8", "UTF-8"};
constexpr Form kEuro{"@euro", "UTF-8"};

// clang-format off
constexpr Family kFamilies[] = {
    {"C",           "English",            "UnitedStates",       "Binary",    {{"", "US-ASCII"}}},
    {"ar_SA",       "Arabic",             "SaudiArabia",        "Default",   {{"", "ISO-8859-6"}, kUtf8}},
    {"bg_BG",       "Bulgarian",          "Bulgaria",           "Default",   {{"", "MS1251"}, kUtf8}},
    {"cs_CZ",       "Czech",              "CzechRepublic",      "Czech",     {{"", "ISO-8859-2"}, kUtf8}},
    {"da_DK",       "Danish",             "Denmark",            "Danish",    {{"", "Latin1"}, kUtf8}},
    {"de_AT",       "German",             "Austria",            "Default",   {{"", "Latin1"}, kUtf8, kEuro}},
    {"de_CH",       "German",             "German-Switzerland", "Default",   {{"", "Latin1"}, kUtf8}},
    {"de_DE",       "German",             "Germany",            "Default",   {{"", "Latin1"}, kUtf8, kEuro}},
    {"el_GR",       "Greek",              "Greece",             "Default",   {{"", "ISO-8859-7"}, kUtf8}},
    {"en_AU",       "English",            "Australia",          "Default",   {{"", "Latin1"}, kUtf8}},
    {"en_CA",       "English",            "Canada",             "Default",   {{"", "Latin1"}, kUtf8}},
    {"en_GB",       "English",            "UnitedKingdom",      "Default",   {{"", "Latin1"}, kUtf8}},
    {"en_US",       "English",            "UnitedStates",       "Default",   {{"", "Latin1"}, kUtf8}},
    {"es_AR",       "Spanish",            "Argentina",          "Spanish",   {{"", "Latin1"}, kUtf8}},
    {"es_ES",       "Spanish",            "Spain",              "Spanish",   {{"", "Latin1"}, kUtf8, kEuro}},
    {"es_MX",       "Spanish",            "Mexico",             "Spanish",   {{"", "Latin1"}, kUtf8}},
    {"fi_FI",       "Finnish",            "Finland",            "Finnish",   {{"", "Latin1"}, kUtf8}},
    {"fr_BE",       "French",             "French-Belgium",     "Default",   {{"", "Latin1"}, kUtf8}},
    {"fr_CA",       "CanadianFrench",     "French-Canada",      "Default",   {{"", "Latin1"}, kUtf8}},
    {"fr_CH",       "French",             "French-Switzerland", "Default",   {{"", "Latin1"}, kUtf8}},
    {"fr_FR",       "French",             "France",             "Default",   {{"", "Latin1"}, kUtf8, kEuro}},
    {"hr_HR",       "Croatian",           "Croatia",            "Croatian",  {{"", "ISO-8859-2"}, kUtf8}},
    {"hu_HU",       "Hungarian",          "Hungary",            "Hungarian", {{"", "ISO-8859-2"}, kUtf8}},
    {"is_IS",       "Icelandic",          "Iceland",            "Default",   {{"", "Latin1"}, kUtf8}},
    {"it_CH",       "Italian",            "Italian-Switzerland", "Default",  {{"", "Latin1"}, kUtf8}},
    {"it_IT",       "Italian",            "Italy",              "Default",   {{"", "Latin1"}, kUtf8, kEuro}},
    {"iw_IL",       "Hebrew",             "Israel",             "Default",   {{"", "ISO-8859-8"}}},
    {"ja_JP",       "Japanese",           "Japan",              "Binary",    {{".eucJP", "JapanEUC"}, {".sjis", "MS932"}, kUtf8}},
    {"ko_KR",       "Korean",             "Korea",              "Binary",    {{".euckr", "MS949"}, kUtf8}},
    {"mk_MK",       "Macedonian",         "Macedonia",          "Default",   {{"", "ISO-8859-5"}, kUtf8}},
    {"nl_BE",       "Dutch",              "Dutch-Belgium",      "Default",   {{"", "Latin1"}, kUtf8, kEuro}},
    {"nl_NL",       "Dutch",              "Netherlands",        "Default",   {{"", "Latin1"}, kUtf8, kEuro}},
    {"no_NO",       "Norwegian",          "Norway",             "Danish",    {{"", "Latin1"}, kUtf8}},
    {"pl_PL",       "Polish",             "Poland",             "Default",   {{"", "ISO-8859-2"}, kUtf8}},
    {"POSIX",       "English",            "UnitedStates",       "Binary",    {{"", "US-ASCII"}}},
    {"pt_BR",       "Portuguese",         "Brazil",             "Default",   {{"", "Latin1"}, kUtf8}},
    {"pt_PT",       "Portuguese",         "Portugal",           "Default",   {{"", "Latin1"}, kUtf8, kEuro}},
    {"ro_RO",       "Romanian",           "Romania",            "Romanian",  {{"", "ISO-8859-2"}, kUtf8}},
    {"ru_RU",       "Russian",            "Russia",             "Default",   {{"", "ISO-8859-5"}, kUtf8}},
    {"sh_YU",       "Serbian",            "Yugoslavia",         "Default",   {{"", "ISO-8859-2"}, kUtf8}},
    {"sk_SK",       "Slovak",             "Slovakia",           "Slovak",    {{"", "ISO-8859-2"}, kUtf8}},
    {"sl_SI",       "Slovenian",          "Slovenia",           "Slovenian", {{"", "ISO-8859-2"}, kUtf8}},
    {"sr_YU",       "Serbian",            "Yugoslavia",         "Default",   {{"", "ISO-8859-2"}, kUtf8}},
    {"sr_YU@cyril", "CyrillicSerbian",    "Yugoslavia",         "Default",   {{"", "ISO-8859-5"}}},
    {"sv_FI",       "Swedish",            "Finland",            "Swedish",   {{"", "Latin1"}, kUtf8, kEuro}},
    {"sv_SE",       "Swedish",            "Sweden",             "Swedish",   {{"", "Latin1"}, kUtf8}},
    {"th_TH",       "Thai",               "Thailand",           "Thai",      {{"", "MS874"}, kUtf8}},
    {"tr_TR",       "Turkish",            "Turkey",             "Turkish",   {{"", "ISO-8859-9"}, kUtf8}},
    {"zh_CN",       "SimplifiedChinese",  "China",              "Binary",    {{"", "MS936"}, kUtf8}},
    {"zh_TW",       "TraditionalChinese", "Taiwan",             "Binary",    {{"", "MS950"}, {".euctw", "EUC-TW"}, kUtf8}},
};
// clang-format on

constexpr size_t kNames = 107;

constexpr size_t count_names() {
  size_t names = 0;
  for (const Family& family : kFamilies)
    for (const Form& form : family.forms) names += form.suffix != nullptr;
  return names;
}
static_assert(count_names() == kNames, "a name was lost or added");

constexpr char kUnknown[] = "Unknown";
constexpr Family kUnknownFamily{kUnknown, kUnknown, kUnknown, kUnknown, {{"", kUnknown}}};

/// What a name stands for.
struct Meaning {
  const Family* family;
  const char* codepage;

  char* write(char* buffer, int32_t size) const {
    if (size > 0)
      snprintf(buffer, static_cast<size_t>(size), "%s_%s.%s@%s", family->language, family->territory, codepage,
               family->sort);
    return buffer;
  }
};

constexpr Meaning kNoMeaning{&kUnknownFamily, kUnknown};

/// Looks up the first `bytes` bytes of a name; kNoMeaning where no name of the table is exactly those.
Meaning find(const char* name, size_t bytes) {
  for (const Family& family : kFamilies) {
    const size_t base = strlen(family.base);
    if (base > bytes || memcmp(name, family.base, base) != 0) continue;
    for (const Form& form : family.forms)
      if (form.suffix != nullptr && strlen(form.suffix) == bytes - base &&
          memcmp(name + base, form.suffix, bytes - base) == 0)
        return {&family, form.codepage};
  }
  return kNoMeaning;
}

/// The meaning of one category of a composite name; a category without its key or its ';' has none.
Meaning find_category(const char* name, const char* key) {
  const char* value = strstr(name, key);
  if (value == nullptr) return kNoMeaning;
  value += strlen(key);
  const char* end = strchr(value, ';');
  return end != nullptr ? find(value, static_cast<size_t>(end - value)) : kNoMeaning;
}

/// Joins what the four categories of a composite name say.
char* map_composite(const char* name, char* buffer, int32_t size) {
  const Meaning codepage = find_category(name, "LC_CTYPE=");
  const Meaning territory = find_category(name, "LC_NUMERIC=");
  const Meaning language = find_category(name, "LC_TIME=");
  const Meaning sort = find_category(name, "LC_COLLATE=");
  const Family joined{"", language.family->language, territory.family->territory, sort.family->sort, {}};
  return Meaning{&joined, codepage.codepage}.write(buffer, size);
}

}  // namespace

extern "C" {

char* LXMapNativeLocale(const char* name, char* buffer, int32_t size) {
  Events events(unit);
  if (name == nullptr) name = "";
  if (strchr(name, ';') != nullptr) return events.exit(map_composite(name, buffer, size));
  LX_TRACE(unit, RAS1_LEVEL_DETAIL, "Searching for %s", name);
  const Meaning meaning = find(name, strlen(name));
  if (meaning.family != &kUnknownFamily) return events.exit(meaning.write(buffer, size));
  memcpy(buffer, kUnknown, sizeof(kUnknown));
  return events.exit(buffer);
}

int32_t LXEnumNativeLocales(LXNativeCallback callback, void* user) {
  Events events(unit);
  for (const Family& family : kFamilies)
    for (const Form& form : family.forms) {
      if (form.suffix == nullptr) continue;
      char native[32], locale[160];
      snprintf(native, sizeof(native), "%s%s", family.base, form.suffix);
      if (callback(user, native, Meaning{&family, form.codepage}.write(locale, sizeof(locale))) == 0)
        return events.exit(LX_OK);
    }
  return events.exit(LX_OK);
}

}  // extern "C"
