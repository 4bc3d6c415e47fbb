// Opening the converters, and the characters on which all libraries agree.
#include "codepages.h"

#include <unicode/ucnv_err.h>

#include <cstdio>
#include <cstring>

namespace bench {
namespace {

const iconv_t kNoDescriptor = reinterpret_cast<iconv_t>(-1);

/// The object's name in the locale directory; empty when it has none.
std::string object_name(const CodepageName& name) {
  int32_t rc = LX_OK;
  const LXObject* object = name.object != nullptr
                               ? LXGetObjFromName(nullptr, LX_CODEPAGE, name.object,
                                                  static_cast<int32_t>(strlen(name.object)), LX_FIND_ONLY, &rc)
                               : LXGetObjFromID(nullptr, LX_CODEPAGE, name.id, LX_FIND_ONLY, &rc);
  const auto* disk = reinterpret_cast<const LXObjDisk*>(object);
  return disk != nullptr && disk->type == LX_CODEPAGE ? disk->name : "";
}

UConverter* open_icu(const char* name) {
  UErrorCode error = U_ZERO_ERROR;
  UConverter* icu = ucnv_open(name, &error);
  if (U_FAILURE(error)) return nullptr;
  ucnv_setToUCallBack(icu, UCNV_TO_U_CALLBACK_STOP, nullptr, nullptr, nullptr, &error);
  ucnv_setFromUCallBack(icu, UCNV_FROM_U_CALLBACK_STOP, nullptr, nullptr, nullptr, &error);
  return icu;
}

constexpr size_t kCharRoom = 16;

std::string icu_bytes(UConverter* icu, char16_t c) {
  char bytes[kCharRoom];
  UErrorCode error = U_ZERO_ERROR;
  const int32_t n = ucnv_fromUChars(icu, bytes, sizeof(bytes), &c, 1, &error);
  return U_FAILURE(error) ? std::string() : std::string(bytes, static_cast<size_t>(n));
}

bool icu_reads(UConverter* icu, const std::string& bytes, char16_t c) {
  char16_t units[kCharRoom];
  UErrorCode error = U_ZERO_ERROR;
  const int32_t n =
      ucnv_toUChars(icu, units, kCharRoom, bytes.data(), static_cast<int32_t>(bytes.size()), &error);
  return U_SUCCESS(error) && n == 1 && units[0] == c;
}

bool iconv_gives(iconv_t descriptor, const void* input, size_t input_bytes, const void* expected,
                 size_t expected_bytes) {
  char bytes[kCharRoom];
  char* end = bytes;
  size_t room = sizeof(bytes);
  if (!run_iconv(descriptor, static_cast<const char*>(input), input_bytes, &end, &room)) return false;
  return sizeof(bytes) - room == expected_bytes && memcmp(bytes, expected, expected_bytes) == 0;
}

}  // namespace

const std::vector<CodepageName>& codepage_names() {
  static const std::vector<CodepageName> kNames = {
      {"Latin1", 819, "Latin1", "ISO-8859-1", "ISO-8859-1", false, {Language::kGerman}},
      {"MS1251", 1251, "MS1251", "ibm-5347_P100-1998", "CP1251", false, {Language::kRussian}},
      {"MS932", 932, "MS932", "ibm-943_P15A-2003", "CP932", false, {Language::kJapanese}},
      {"MS936", 936, "MS936", "windows-936-2000", "CP936", false, {Language::kChinese}},
      {"930", 930, nullptr, "ibm-930", "IBM930", true, {Language::kJapanese}},
      {"939", 939, nullptr, "ibm-939", "IBM939", true, {Language::kJapanese}},
      {"UTF-8",
       57352,
       "UTF-8",
       "UTF-8",
       "UTF-8",
       false,
       {Language::kGerman, Language::kRussian, Language::kJapanese, Language::kChinese}},
  };
  return kNames;
}

std::unique_ptr<Codepage> Codepage::open(const CodepageName& name) {
  std::unique_ptr<Codepage> codepage(new Codepage(name));
  if (codepage->open_all()) return codepage;
  std::fprintf(stderr, "%s: not in the locale directory, ICU or iconv; its rows are left out\n", name.label);
  return nullptr;
}

bool Codepage::open_all() {
  const std::string object = object_name(name_);
  if (!object.empty()) locale_ = LXGetLocale(("English." + object).c_str(), 0, nullptr);
  icu_ = open_icu(name_.icu);
  to_utf16_ = iconv_open("UTF-16LE", name_.iconv);
  from_utf16_ = iconv_open(name_.iconv, "UTF-16LE");
  to_utf8_ = iconv_open("UTF-8", name_.iconv);
  from_utf8_ = iconv_open(name_.iconv, "UTF-8");
  return locale_ != nullptr && icu_ != nullptr && to_utf16_ != kNoDescriptor && from_utf16_ != kNoDescriptor &&
         to_utf8_ != kNoDescriptor && from_utf8_ != kNoDescriptor;
}

Codepage::~Codepage() {
  LXReleaseLocale(locale_);
  ucnv_close(icu_);
  for (iconv_t descriptor : {to_utf16_, from_utf16_, to_utf8_, from_utf8_})
    if (descriptor != kNoDescriptor) iconv_close(descriptor);
}

bool Codepage::is_utf8() const {
  return strcmp(name_.label, "UTF-8") == 0;
}

std::string Codepage::encode(const std::u16string& text) const {
  std::string bytes(4 * text.size() + 2, '\0');
  const int32_t size = static_cast<int32_t>(bytes.size());
  const auto* units = reinterpret_cast<const LXUChar*>(text.data());
  const int32_t n = LXUnicodeToStringEx(locale_, bytes.data(), LX_SHIFT_SINGLE, size, units,
                                        static_cast<int32_t>(text.size()), LX_TERMINATE);
  bytes.resize(n > 0 ? static_cast<size_t>(n) - 1 : 0);
  return bytes;
}

size_t Codepage::agreed_bytes(char16_t c) const {
  const std::string bytes = encode(std::u16string(1, c));
  LXUChar back[2] = {};
  const int32_t units = LXStringToUnicodeEx(back, 2, locale_, bytes.data(), LX_SHIFT_SINGLE,
                                            static_cast<int32_t>(bytes.size()), 0);
  if (units != 1 || back[0] != c || icu_bytes(icu_, c) != bytes || !icu_reads(icu_, bytes, c)) return 0;
  if (!iconv_gives(from_utf16_, &c, sizeof(c), bytes.data(), bytes.size())) return 0;
  if (!iconv_gives(to_utf16_, bytes.data(), bytes.size(), &c, sizeof(c))) return 0;
  const bool shifted = name_.stateful && bytes.size() > 1;
  return bytes.size() - (shifted ? 2 : 0);
}

bool run_iconv(iconv_t descriptor, const char* input, size_t input_bytes, char** output, size_t* room) {
  char* in = const_cast<char*>(input);
  iconv(descriptor, nullptr, nullptr, nullptr, nullptr);
  return iconv(descriptor, &in, &input_bytes, output, room) == 0 &&
         iconv(descriptor, nullptr, nullptr, output, room) == 0;
}

}  // namespace bench
