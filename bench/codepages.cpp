#include "codepages.h"

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <map>

#include "icu.h"
#include "texts.h"

namespace bench {
namespace {

constexpr size_t kCharRoom = 16;
const iconv_t kNoDescriptor = reinterpret_cast<iconv_t>(-1);

constexpr Encoding kEncodings[] = {
    {"UTF-16", "UTF-16LE", "UTF-16LE", false},
    {"UTF-8", "UTF-8", "UTF-8", false},
    {"Latin1", "ISO-8859-1", "ISO-8859-1", false},
    {"IBM1141", "ibm-1141", "IBM1141", false},
    {"MS1251", "ibm-5347_P100-1998", "CP1251", false},
    {"KOI8-R", "KOI8-R", "KOI8-R", false},
    {"MS1253", "ibm-5349_P100-1998", "CP1253", false},
    {"MS874", "windows-874-2000", "CP874", false},
    {"MS932", "ibm-943_P15A-2003", "CP932", false},
    {"JapanEUC", "ibm-33722_P12A_P12A-2009_U2", "EUC-JP-MS", false},
    {"MS936", "windows-936-2000", "CP936", false},
    {"MS949", "windows-949-2000", "CP949", false},
    {"EUC-KR", "ibm-970_P110_P110-2006_U2", "EUC-KR", false},
    {"MS950", "windows-950-2000", "CP950", false},
    {"IBM930", "ibm-930", "IBM930", true},
    {"IBM939", "ibm-939", "IBM939", true},
};

}  // namespace

const Encoding* find_encoding(const char* label) {
  for (const Encoding& encoding : kEncodings)
    if (strcmp(encoding.label, label) == 0) return &encoding;
  return nullptr;
}

bool is_utf16(const Encoding& encoding) {
  return strcmp(encoding.label, "UTF-16") == 0;
}
bool is_utf8(const Encoding& encoding) {
  return strcmp(encoding.label, "UTF-8") == 0;
}

LocalePointer open_locale(const std::string& name) {
  int32_t rc = LX_OK;
  LocalePointer locale(LXGetLocale(name.c_str(), 0, &rc), LXReleaseLocale);
  if (locale == nullptr) std::fprintf(stderr, "no locale %s (%d); its rows are left out\n", name.c_str(), rc);
  return locale;
}

std::shared_ptr<const Codepage> Codepage::open(const Encoding& encoding) {
  const std::shared_ptr<Codepage> codepage(new Codepage(encoding));
  if (is_utf16(encoding)) return codepage;
  codepage->locale_ = open_locale(std::string("English.") + encoding.label);
  codepage->to_utf16_ = iconv_open("UTF-16LE", encoding.iconv);
  codepage->from_utf16_ = iconv_open(encoding.iconv, "UTF-16LE");
  if (codepage->locale_ != nullptr && codepage->to_utf16_ != kNoDescriptor &&
      codepage->from_utf16_ != kNoDescriptor)
    return codepage;
  std::fprintf(stderr, "%s: not in the locale directory or iconv; its rows are left out\n", encoding.label);
  return nullptr;
}

Codepage::~Codepage() {
  for (iconv_t descriptor : {to_utf16_, from_utf16_})
    if (descriptor != nullptr && descriptor != kNoDescriptor) iconv_close(descriptor);
}

std::string Codepage::encode(const std::u16string& text) const {
  if (is_utf16(encoding_)) return utf16_bytes(text);
  std::string bytes(4 * text.size() + 2, '\0');
  const auto* units = reinterpret_cast<const LXUChar*>(text.data());
  const int32_t n = LXUnicodeToStringEx(locale_.get(), bytes.data(), LX_SHIFT_SINGLE, length(bytes.size()),
                                        units, length(text.size()), LX_TERMINATE);
  bytes.resize(n > 0 ? static_cast<size_t>(n) - 1 : 0);
  return bytes;
}

bool Codepage::is_agreed(char16_t c) const {
  if (is_utf16(encoding_)) return true;
  const std::string bytes = encode(std::u16string(1, c));
  LXUChar back[2] = {};
  const int32_t units =
      LXStringToUnicodeEx(back, 2, locale_.get(), bytes.data(), LX_SHIFT_SINGLE, length(bytes.size()), 0);
  if (units != 1 || back[0] != c || !icu::reads_and_writes(encoding_, bytes, c)) return false;
  char out[kCharRoom];
  if (run_iconv(from_utf16_, reinterpret_cast<const char*>(&c), sizeof(c), out, kCharRoom) != bytes.size() ||
      memcmp(out, bytes.data(), bytes.size()) != 0)
    return false;
  return run_iconv(to_utf16_, bytes.data(), bytes.size(), out, kCharRoom) == sizeof(c) &&
         memcmp(out, &c, sizeof(c)) == 0;
}

std::u16string agreed_text(const std::u16string& text, const std::vector<const Codepage*>& codepages,
                           size_t chars) {
  std::map<char16_t, bool> known;
  std::u16string kept;
  for (const char16_t c : text) {
    if (kept.size() == chars) break;
    const auto [place, is_new] = known.try_emplace(c, false);
    if (is_new)
      place->second = std::all_of(codepages.begin(), codepages.end(),
                                  [c](const Codepage* codepage) { return codepage->is_agreed(c); });
    if (place->second) kept += c;
  }
  return kept;
}

Input cut_pieces(const std::u16string& text, size_t chars, size_t pieces, const Codepage& codepage) {
  auto cut = std::make_shared<Pieces>();
  for (size_t at = 0; at < text.size() && cut->ends.size() < pieces; at += chars) {
    const std::u16string piece = text.substr(at, chars);
    cut->bytes += codepage.encode(piece);
    cut->ends.push_back(cut->bytes.size());
    cut->chars += piece.size();
  }
  return cut;
}

size_t run_iconv(iconv_t descriptor, const char* input, size_t input_bytes, char* output, size_t room) {
  char *in = const_cast<char*>(input), *end = output;
  iconv(descriptor, nullptr, nullptr, nullptr, nullptr);
  const bool done = iconv(descriptor, &in, &input_bytes, &end, &room) == 0 &&
                    iconv(descriptor, nullptr, nullptr, &end, &room) == 0;
  return done ? static_cast<size_t>(end - output) : 0;
}

}  // namespace bench
