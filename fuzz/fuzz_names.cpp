// Names of locales and objects, of any kind: the three forms find the same locale, whose own name finds it again; names
// and identifiers lead to each other; and the operating system's names come back.
#include <cstring>

#include "fuzz.h"
#include "nls1.h"
#include "support/library.h"

namespace lx::fuzz::names {
namespace {

std::string name_in(Input& in) {
  static constexpr const char* kParts[] = {"English",
                                           "german",
                                           "Japanese",
                                           "_",
                                           "_Germany",
                                           "_japan",
                                           "_UnitedStates",
                                           ".",
                                           ".UTF-8",
                                           ".ms932",
                                           ".IBM930",
                                           ".l1",
                                           "@",
                                           "@Binary",
                                           "@default",
                                           "@Czech",
                                           "C",
                                           "de_DE",
                                           "de_DE.utf8",
                                           "@euro",
                                           "ja_JP.sjis",
                                           "/",
                                           "LC_CTYPE=",
                                           ";",
                                           "LC_TIME=de_DE;LC_NUMERIC=fr_FR",
                                           "Unknown",
                                           " "};
  std::string name;
  for (uint32_t count = in.below(6); count != 0; --count)
    if (in.flag())
      name += in.bytes(8);
    else
      name += in.one_of(kParts);
  return name.c_str();
}

std::string text_item(LXLocale* l, int32_t number) {
  const Units said = item(l, number);
  return std::string(said.begin(), said.end());
}

void locales(const std::string& name, int32_t flags) {
  int32_t rc = LX_OK, rc_wide = LX_OK, rc_units = LX_OK;
  const bool ascii =
      std::all_of(name.begin(), name.end(), [](char c) { return static_cast<uint8_t>(c) < 0x80; });
  const LocalePtr l(LXGetLocale(name.c_str(), flags, &rc));
  const LocalePtr wide(LXGetLocaleW(Text<LXWChar>(name.begin(), name.end()).c_str(), flags, &rc_wide));
  const LocalePtr unicode(LXGetLocaleU(units(name).c_str(), flags, &rc_units));
  must((l != nullptr) == (rc == LX_OK), "a locale or a code");
  must(!ascii || (rc == rc_wide && rc == rc_units), "a name says the same in all forms");
  if (!l) return;
  const std::string own = text_item(l.get(), LX_ITEM_LOCALE_STRING);
  must(!ascii || (text_item(wide.get(), LX_ITEM_LOCALE_STRING) == own &&
                  text_item(unicode.get(), LX_ITEM_LOCALE_STRING) == own),
       "the same locale");
  const LocalePtr again(LXGetLocale(own.c_str(), 0, nullptr));
  must(again && text_item(again.get(), LX_ITEM_LOCALE_STRING) == own, "a locale has its name");
  const Block<uint8_t> digest(LX_DIGEST_BYTES), other(LX_DIGEST_BYTES);
  for (int32_t type = LX_LANGUAGE - 1; type <= LX_SORT + 1; ++type) {
    const int32_t bytes = LXGetLocaleDigest(l.get(), type, digest.data(), digest.size());
    must(bytes == LXGetLocaleDigest(again.get(), type, other.data(), other.size()) &&
             memcmp(digest.data(), other.data(), static_cast<size_t>(bytes)) == 0,
         "and its digests");
  }
  char native[12];
  if (LXConvertLocale(l.get(), native, LX_FALLBACK) == 1) {
    int32_t native_rc = LX_OK;
    LXReleaseLocale(LXConvertNativeLocale(native, LX_FALLBACK, &native_rc));
    must(native_rc == LX_OK, "an operating system's name is known");
  }
  NLS1_SetNativeFromLocale(l.get(), 0, LX_FALLBACK);
}

void defaults(const std::string& name, int32_t flags) {
  const int32_t code = LXSetLocale(name.c_str(), flags);
  LXReleaseLocale(LXGetLocale(name.c_str(), flags, nullptr));
  must(
      LXSetLocaleW(Text<LXWChar>(name.begin(), name.end()).c_str(), 0) != LX_OK || LXGetError(nullptr) == LX_OK,
      "a default is clean");
  LXSetLocaleU(units(name).c_str(), 0);
  must(code != LX_OK || !text_item(nullptr, LX_ITEM_LOCALE_STRING).empty(), "a default has a name");
  must(LXSetLocale("English_UnitedStates.US-ASCII@BINARY", 0) == LX_OK, "a default is set");
}

void native_names(Input& in, const std::string& name) {
  const Block<char> mapped(8 + in.below(60));
  const Block<char> given(name + '\0');
  must(LXMapNativeLocale(given.data(), mapped.data(), mapped.size()) == mapped.data(), "a name is mapped");
  must(memchr(mapped.data(), 0, static_cast<size_t>(mapped.size())) != nullptr, "and ends");
  int32_t rc = LX_OK;
  const LocalePtr l(LXConvertNativeLocale(given.data(), in.below(8), &rc));
  must((l != nullptr) == (rc == LX_OK), "a locale or a code");
  if (l) LXMapNativeInfo(given.data(), l.get());
  LXReleaseLocale(NLS1_ConvertNativeLocale(given.data(), LX_FALLBACK, &rc));
  setenv("LX_LANG", name.c_str(), 1);
  const Block<char> user(8 + in.below(60));
  LXGetUserLocale(user.data(), user.size());
  LXReleaseLocale(LXGetLocale(nullptr, LX_USER_LOCALE | LX_FALLBACK, nullptr));
  unsetenv("LX_LANG");
}

/// A name leads to an identifier, and that to the name.
void identifiers(Input& in, const std::string& name) {
  using Id = int32_t (*)(const char*, int32_t*);
  using Name = int32_t (*)(int32_t, char*, int32_t);
  static constexpr std::pair<Id, Name> kDoors[] = {{NLS1_GetLanguageId, NLS1_GetLanguageName},
                                                   {NLS1_GetTerritoryId, NLS1_GetTerritoryName},
                                                   {NLS1_GetCodepageId, NLS1_GetCodepageName},
                                                   {NLS1_GetSortId, NLS1_GetSortName}};
  const std::string one = name.substr(0, name.find_first_of("_.@"));
  const auto any = static_cast<int32_t>(in.below(0x10000));
  for (const auto& door : kDoors) {
    const Id id_of = door.first;
    const Name name_of = door.second;
    int32_t rc = LX_OK, rc_again = LX_OK;
    const int32_t id = id_of(one.c_str(), &rc);
    for (const int32_t asked : {id, any}) {
      char text[40];
      if (name_of(asked, text, sizeof(text)) != LX_OK || text[0] == 0) continue;
      must(id_of(text, &rc_again) == asked && rc_again == LX_OK, "an identifier has a name");
      must(written<char>([&](char* to, int32_t size) { return name_of(asked, to, size) == LX_OK ? 1 : 0; },
                         strlen(text) + 1)
                   .size() == 1,
           "which fits its bytes");
    }
  }
  const int32_t language = static_cast<int32_t>(in.below(300)), territory = static_cast<int32_t>(in.below(900));
  const int32_t both = NLS1_LANGUAGE_TERRITORY(language, territory);
  int32_t rc = LX_OK;
  const int32_t flags = static_cast<int32_t>(in.below(8));
  const LocalePtr l(NLS1_GetLocale(both, in.flag() ? 0 : any, flags, &rc));
  must((l != nullptr) == (rc == LX_OK), "a locale or a code");
  must(!l || language == 0 || flags != 0 || LXGetLocaleNumInfo(l.get(), LX_ITEM_LANGUAGE_ID, 0) == language,
       "of that language");
  NLS1_SetLocale(both, 0, in.flag() ? NLS1_THREAD : LX_FALLBACK);
  NLS1_SetLocaleFromNative(name.c_str(), in.flag() ? NLS1_THREAD : NLS1_PROCESS);
  NLS1_SetNativeLocale(both, 0, static_cast<int32_t>(in.below(7)), LX_FALLBACK);
  NLS1_PrivateFunction_GetProcessLocale();
  must(NLS1_PrivateFunction_GetThreadLocale() != nullptr, "a thread has a locale");
}

/// Once: every name that is listed means what it is listed with.
bool listed() {
  return LXEnumNativeLocales(
             [](void*, const char* native, const char* name) {
               char mapped[100];
               must(strcmp(LXMapNativeLocale(native, mapped, sizeof(mapped)), name) == 0,
                    "a listed name is mapped");
               return 1;
             },
             nullptr) == LX_OK;
}

}  // namespace

FUZZ_TARGET(names) {
  setenv("NLS1_LOCALEDIR", LEXICOR_LOCALE_DIR, 1);
  open_directory();
  static const bool all_listed = listed();
  must(all_listed, "names are listed");
  const uint32_t kind = in.below(4);
  const auto flags = static_cast<int32_t>(in.below(9));
  const std::string name = name_in(in);
  if (kind == 0) locales(name, flags);
  if (kind == 1) defaults(name, flags);
  if (kind == 2) native_names(in, name);
  if (kind == 3) identifiers(in, name);
}

}  // namespace lx::fuzz::names
