// Upper and lower case beside ICU, libunistring and glibc's towupper and towlower, with the special mappings of
// the text's language.
#include <locale.h>
#include <wchar.h>
#include <wctype.h>

#include <map>

#include "codepages.h"
#include "families.h"
#include "icu.h"
#include "system.h"

namespace bench {
namespace {

constexpr size_t kLongUnits = 500000;
constexpr size_t kShortChars = 24;

struct Subject {
  const char* text;
  const char* encoding;
  const char* language;  // the library's name
  const char* code;      // the one of ICU and libunistring
  const char* system;    // glibc's locale, where its mapping of single characters gives the same; or null
};
constexpr Subject kSubjects[] = {
    {"ASCII", "UTF-8", "English", "en", "en_US.UTF-8"},
    {"German", "UTF-8", "German", "de", nullptr},
    {"French", "UTF-8", "French", "fr", "fr_FR.UTF-8"},
    {"Russian", "UTF-8", "Russian", "ru", "ru_RU.UTF-8"},
    {"Greek", "UTF-8", "Greek", "en", "en_US.UTF-8"},
    {"Japanese", "UTF-8", "Japanese", "ja", "ja_JP.UTF-8"},
    {"Russian", "UTF-16", "Russian", "ru", "ru_RU.UTF-8"},
    {"German", "UTF-16", "German", "de", nullptr},
    {"ASCII", "UTF-16", "English", "en", "en_US.UTF-8"},
    {"Russian", "MS1251", "Russian", "ru", "ru_RU.CP1251"},
    {"Japanese", "MS932", "Japanese", "ja", "ja_JP.WINDOWS-31J"},
};

Work ours(const Input& input, const Encoding& encoding, const LocalePointer& locale, uint32_t mode) {
  if (is_utf16(encoding))
    return for_each_piece(input, [locale, mode](const char* in, size_t bytes, char* out) {
      return 2 * count(LXMapStringU(locale.get(), reinterpret_cast<LXUChar*>(out), length(bytes),
                                    reinterpret_cast<const LXUChar*>(in), length(bytes / 2), mode));
    });
  return for_each_piece(input, [locale, mode](const char* in, size_t bytes, char* out) {
    return count(LXMapString(locale.get(), out, length(2 * bytes), in, length(bytes), mode));
  });
}

/// glibc maps wide characters: 16-bit units are mapped one by one, bytes are converted there and back.
Work glibc_peer(const Input& input, const Encoding& encoding, const char* locale_name, bool is_upper) {
  const SystemLocale system = open_system_locale(locale_name);
  if (system == nullptr) return nullptr;
  wint_t (*const map)(wint_t, locale_t) = is_upper ? towupper_l : towlower_l;
  if (is_utf16(encoding))
    return for_each_piece(input, [system, map](const char* in, size_t bytes, char* out) {
      const auto* const units = reinterpret_cast<const char16_t*>(in);
      auto* const mapped = reinterpret_cast<char16_t*>(out);
      for (size_t i = 0; i < bytes / 2; ++i) mapped[i] = static_cast<char16_t>(map(units[i], system.get()));
      return bytes;
    });
  auto wide = std::make_shared<std::vector<wchar_t>>(input->bytes.size());
  return for_each_piece(input, [system, map, wide](const char* in, size_t bytes, char* out) {
    const locale_t before = uselocale(system.get());
    std::mbstate_t state{};
    const size_t chars = mbsnrtowcs(wide->data(), &in, bytes, wide->size(), &state);
    for (size_t i = 0; i < chars; ++i)
      (*wide)[i] = static_cast<wchar_t>(map(static_cast<wint_t>((*wide)[i]), system.get()));
    const wchar_t* from = wide->data();
    const size_t written = wcsnrtombs(out, &from, chars, 2 * bytes, &state);
    uselocale(before);
    return written;
  });
}

class SubjectRows {
 public:
  /// `codepage` and `locale` are there.
  SubjectRows(const Subject& subject, const Codepage& codepage, LocalePointer locale, bool is_upper)
      : subject_(subject), codepage_(codepage), locale_(std::move(locale)), is_upper_(is_upper) {}

  void add(const std::string& stem, const std::u16string& whole, Table* table) const {
    const std::u16string text = mapped_alike(agreed_text(whole, {&codepage_}, kLongUnits));
    for (const bool is_short : {false, true}) {
      const Input input = is_short ? cut_pieces(text, kShortChars, kManyPieces, codepage_)
                                   : cut_pieces(text, text.size(), 1, codepage_);
      table->add(
          {stem + (is_short ? "/24" : "/1MB"), peers(input), input->chars, input->ends.size(), room(input)});
    }
  }

 private:
  static size_t room(const Input& input) { return 3 * input->bytes.size() + 64; }

  std::vector<Peer> peers(const Input& input) const {
    const Encoding& encoding = codepage_.encoding();
    return {{kOurs, ours(input, encoding, locale_, is_upper_ ? LX_MAP_UPPER : LX_MAP_LOWER)},
            {kIcu, icu::map(input, encoding, subject_.code, is_upper_)},
            {kUnistring, unistring::map(input, encoding, subject_.code, is_upper_)},
            {kGlibc,
             subject_.system == nullptr ? nullptr : glibc_peer(input, encoding, subject_.system, is_upper_)}};
  }

  /// The characters that all libraries map alike behind a letter: the form of some depends on what stands
  /// there.
  std::u16string mapped_alike(const std::u16string& text) const {
    std::map<char16_t, bool> known;
    std::u16string kept;
    for (const char16_t c : text) {
      const auto [place, is_new] = known.try_emplace(c, false);
      if (is_new) {
        const Input input = cut_pieces({u'a', c}, 2, 1, codepage_);
        place->second = differing(peers(input), room(input), Same::kBytes) == nullptr;
      }
      if (place->second) kept += c;
    }
    return kept;
  }

  const Subject& subject_;
  const Codepage& codepage_;
  LocalePointer locale_;
  bool is_upper_;
};

}  // namespace

void add_mapping_rows(Table* table, Texts* texts) {
  for (const Subject& subject : kSubjects) {
    for (const bool is_upper : {true, false}) {
      const std::string stem =
          std::string("map/") + subject.text + "/" + subject.encoding + (is_upper ? "/upper" : "/lower");
      if (!table->wants(stem + "/1MB") && !table->wants(stem + "/24")) continue;
      const Encoding& encoding = *find_encoding(subject.encoding);
      const auto codepage = Codepage::open(encoding);
      const LocalePointer locale =
          open_locale(std::string(subject.language) + "." + (is_utf16(encoding) ? "UTF-8" : encoding.label));
      const std::u16string& text = texts->find(subject.text);
      if (codepage != nullptr && locale != nullptr && !text.empty())
        SubjectRows(subject, *codepage, locale, is_upper).add(stem, text, table);
    }
  }
}

}  // namespace bench
