// The locales that targets run in.
#include <map>

#include "fuzz.h"
#include "support/library.h"

namespace lx::fuzz {

void open_directory() {
  static const Library library(LEXICOR_LOCALE_DIR);
}

const Place& place_in(const std::string& codepage, const std::string& sort, const std::string& language) {
  open_directory();
  static std::map<std::string, LocalePtr> locales;
  static std::map<std::string, Place> places;
  const std::string name = language + "." + codepage + "@" + sort;
  const auto found = places.find(name);
  if (found != places.end()) return found->second;
  LXLocale* const l = LXGetLocale(name.c_str(), 0, nullptr);
  must(l != nullptr, "the directory has the locale");
  locales[name].reset(l);
  const auto object = [](int32_t type, const std::string& of) {
    int32_t rc = LX_OK;
    const LXObject* const found_object =
        LXGetObjFromName(nullptr, type, of.data(), count_of(of), LX_FIND_AND_LOAD, &rc);
    must(rc == LX_OK, "a locale's objects are found");
    return found_object;
  };
  const auto number = [&](int32_t item_number) { return LXGetLocaleNumInfo(l, item_number, 0); };
  const Place made{l,
                   object(LX_CODEPAGE, codepage),
                   object(LX_SORT, sort),
                   number(LX_ITEM_CODEPAGE_WIDTH),
                   number(LX_ITEM_CODEPAGE_SHIFT) != 0,
                   number(LX_ITEM_CODEPAGE_ASCII) != 0};
  return places.emplace(name, made).first->second;
}

const Place& place(Input& in) {
  // Single-byte, EBCDIC, with shift bytes, of two, three and four bytes, and computed.
  static constexpr const char* kCodepages[] = {"Latin1", "UTF-8",    "MS932",  "IBM930", "IBM1047",
                                               "IBM939", "JapanEUC", "EUC-TW", "MS936",  "US-ASCII"};
  // Pairs, expansions, weights that are inserted, none at all.
  static constexpr const char* kSorts[] = {"BINARY", "Default", "Czech",   "FrenchCanadian",
                                           "Thai",   "Danish",  "Japanese"};
  // With special mappings, with separators of several bytes, with long names.
  static constexpr const char* kLanguages[] = {"English_UnitedStates", "German_Germany", "Turkish_Turkey",
                                               "French_France",        "Japanese_Japan", "Greek_Greece"};
  const char* const codepage = in.one_of(kCodepages);
  const char* const sort = in.one_of(kSorts);
  return place_in(codepage, sort, in.one_of(kLanguages));
}

}  // namespace lx::fuzz
