// Items of a locale of its own, set and read in all forms, with the territory and the codepage changed in between: what
// is refused changes nothing, and what is set is read.
#include "files.h"
#include "nls1.h"
#include "support/library.h"

namespace lx::fuzz::items {
namespace {

constexpr int32_t kTexts[] = {LX_ITEM_CURRENCY,    LX_ITEM_POSITIVE_SIGN,     LX_ITEM_NEGATIVE_SIGN,
                              LX_ITEM_TIME_FORMAT, LX_ITEM_SHORT_DATE_FORMAT, LX_ITEM_LONG_DATE_FORMAT};

/// Codepages without shift bytes have one byte form; its door for items is in two layers.
template <class F>
int32_t set(Input& in, const F& form, LXLocale* l, int32_t number, const Text<typename F::Unit>& text) {
  const Block<typename F::Unit> block(text);
  const typename F::Unit* const p = block.data();
  const int32_t n = block.size();
  states = {};
  if (in.flag()) return form.set_item(l, number, p, n, 0);
  if constexpr (std::is_same_v<F, Plain>) return NLS1_SetLocaleTextInfo(l, number, p, n, 0);
  if constexpr (std::is_same_v<F, Wide>) return NLS1_SetLocaleTextInfoW(l, number, p, n, 0);
  if constexpr (std::is_same_v<F, Unicode>) return NLS1_SetLocaleTextInfoU(l, number, p, n, 0);
  if constexpr (std::is_same_v<F, Ex>) return NLS1_SetLocaleTextInfoEx(l, number, p, 0, n, 0);
}

/// In exactly the room that it takes, and alike through both layers.
void get(LXLocale* l, int32_t number, int32_t flags) {
  const auto bytes =
      written<char>([&](char* to, int32_t n) { return LXGetLocaleTextInfo(l, number, to, n, flags); }, 700);
  must(written<char>([&](char* to, int32_t n) { return NLS1_GetLocaleTextInfo(l, number, to, n, flags); },
                     bytes.size()) == bytes,
       "both layers give one text");
  const auto shifted = written<char>(
      [&](char* to, int32_t n) { return LXGetLocaleTextInfoEx(l, number, to, 0, n, flags); }, 700);
  must(written<char>([&](char* to, int32_t n) { return NLS1_GetLocaleTextInfoEx(l, number, to, 0, n, flags); },
                     shifted.size()) == shifted,
       "with shift bytes too");
  const auto codes = written<LXWChar>(
      [&](LXWChar* to, int32_t n) { return LXGetLocaleTextInfoW(l, number, to, n, flags); }, 300);
  must(
      written<LXWChar>([&](LXWChar* to, int32_t n) { return NLS1_GetLocaleTextInfoW(l, number, to, n, flags); },
                       codes.size()) == codes,
      "codes too");
  const auto units = written<LXUChar>(
      [&](LXUChar* to, int32_t n) { return LXGetLocaleTextInfoU(l, number, to, n, flags); }, 300);
  must(
      written<LXUChar>([&](LXUChar* to, int32_t n) { return NLS1_GetLocaleTextInfoU(l, number, to, n, flags); },
                       units.size()) == units,
      "units too");
  must(NLS1_GetLocaleNumInfo(l, number, flags) == LXGetLocaleNumInfo(l, number, flags) ||
           number == LX_ITEM_DEFAULT_CODEPAGE,
       "both layers give one number");
}

void set_text(Input& in, LXLocale* l) {
  const bool text_item = in.flag();
  const int32_t number = text_item ? in.one_of(kTexts) : static_cast<int32_t>(in.below(90));
  const Units said = in.units(40);
  const uint32_t kind = in.below(4);
  const std::string before = state_of(l);
  int32_t done = 0;
  uint32_t at = 0;
  in_all_forms([&](const auto& form) {
    if (at++ != kind) return;
    const auto text = encode(form, l, said);
    done = set(in, form, l, number, text);
    if (done != 1 || !text_item || said.empty() || !faithful(form, l, said, text)) return;
    // A text ends at its null.
    must(item(l, number) == said.substr(0, said.find(LXUChar{0})), "what is set is read");
  });
  must(done == 1 || state_of(l) == before, "what is refused changes nothing");
}

void change(Input& in, LXLocale* l) {
  static constexpr const char* kTerritories[] = {"Germany", "Japan", "France", "UnitedStates", "Oman"};
  static constexpr const char* kCodepages[] = {"Latin1", "UTF-8", "MS932", "IBM930", "IBM1047", "US-ASCII"};
  const std::string before = state_of(l);
  int32_t rc = LX_OK;
  const auto object = [&](int32_t type, const std::string& name) {
    return LXGetObjFromName(nullptr, type, name.data(), count_of(name), LX_FIND_AND_LOAD, &rc);
  };
  int32_t code = LX_OK;
  switch (in.below(4)) {
    case 0:
      code = LXLocaleChangeTerritory(l, object(LX_TERRITORY, in.one_of(kTerritories)));
      break;
    case 1:
      code = LXLocaleChangeCodePage(l, object(LX_CODEPAGE, in.one_of(kCodepages)));
      break;
    case 2:
      code = LXLocaleSetModifiable(l);
      break;
    default: {
      const auto number = static_cast<int32_t>(in.below(90));
      const int32_t value = in.flag() ? in.byte() : in.integer();
      code = (in.flag() ? LXSetLocaleNumInfo(l, number, value) : NLS1_SetLocaleNumInfo(l, number, value)) == 1
                 ? LX_OK
                 : LXGetError(l);
    }
  }
  must(code == LX_OK || state_of(l) == before, "what fails changes nothing");
}

}  // namespace

FUZZ_TARGET(items) {
  const Units name = item(place(in).locale, LX_ITEM_LOCALE_STRING);
  int32_t rc = LX_OK;
  const LocalePtr l(LXGetLocaleU(name.c_str(), 0, &rc));
  must(l != nullptr, "a locale has a name");
  while (in.left() != 0) {
    if (in.flag())
      set_text(in, l.get());
    else
      change(in, l.get());
    const auto number = static_cast<int32_t>(in.below(90));
    get(l.get(), number, static_cast<int32_t>(in.below(2)));
  }
  use_items(l.get());
}

}  // namespace lx::fuzz::items
