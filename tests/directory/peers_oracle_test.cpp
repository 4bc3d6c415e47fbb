// Every shipped codepage, whose object is what the library converts by (codepages_test.cpp), against ICU's converter
// of the same name in the source, and against iconv where glibc has the charset: all characters of up to four bytes,
// and all 65,536 Unicode values. What differs is counted by codepage, direction and kind, and must be what
// peer_differences.txt lists, each line with its reason.
#include <gtest/gtest.h>
#include <iconv.h>
#include <unicode/uchar.h>
#include <unicode/ucnv.h>
#include <unicode/unorm2.h>

#include <functional>
#include <memory>
#include <sstream>

#include "directory/directory_codepages.h"
#include "directory/listed_differences.h"
#include "import/icu_text.h"
#include "lexicor/hex.h"
#include "support/case_rows.h"

namespace lx::test {
namespace {

constexpr uint32_t kNone = 0xFFFFFFFF;

using Convert = std::function<std::string(const std::string&)>;

/// A converter, character by character between its bytes and UTF-16LE: empty where there is no mapping.
struct Peer {
  Convert decode, encode;  // none: there is no such converter

  uint32_t to_unicode(const std::string& text) const {
    const std::string unit = decode(text);
    const auto byte = [&](size_t i) { return static_cast<uint32_t>(static_cast<uint8_t>(unit[i])); };
    return unit.size() == 2 && unit != "\xFD\xFF" ? byte(0) | byte(1) << 8 : kNone;
  }
  std::string from_unicode(uint32_t u) const {
    return encode({static_cast<char>(u), static_cast<char>(u >> 8)});
  }
};

Peer icu_peer(const std::string& name) {
  UErrorCode opened = U_ZERO_ERROR;
  const std::shared_ptr<UConverter> converter(ucnv_open(name.c_str(), &opened), ucnv_close);
  if (U_FAILURE(opened)) return {};
  ucnv_setFallback(converter.get(), 1);
  ucnv_setToUCallBack(converter.get(), UCNV_TO_U_CALLBACK_STOP, nullptr, nullptr, nullptr, &opened);
  ucnv_setFromUCallBack(converter.get(), UCNV_FROM_U_CALLBACK_STOP, nullptr, nullptr, nullptr, &opened);
  const auto convert = [converter](bool encode) {
    return [converter, encode](const std::string& text) {
      UErrorCode status = U_ZERO_ERROR;
      char out[32];
      UConverter* const c = converter.get();
      const auto length = static_cast<int32_t>(text.size());
      const int32_t n =
          encode ? ucnv_fromAlgorithmic(c, UCNV_UTF16_LittleEndian, out, 32, text.data(), length, &status)
                 : ucnv_toAlgorithmic(UCNV_UTF16_LittleEndian, c, out, 32, text.data(), length, &status);
      return U_SUCCESS(status) ? std::string(out, static_cast<size_t>(n)) : std::string();
    };
  };
  return {convert(false), convert(true)};
}

/// Converts a text between glibc's charsets; nothing where it has none of these.
Convert iconv_of(const std::string& to, const std::string& from) {
  const iconv_t opened = iconv_open(to.c_str(), from.c_str());
  if (opened == reinterpret_cast<iconv_t>(-1)) return {};
  return [converter = std::shared_ptr<void>(opened, iconv_close)](std::string text) {
    char out[32];
    char *in_pointer = text.data(), *out_pointer = out;
    size_t in_left = text.size(), out_left = sizeof(out);
    iconv(converter.get(), nullptr, nullptr, nullptr, nullptr);
    if (iconv(converter.get(), &in_pointer, &in_left, &out_pointer, &out_left) != 0 || in_left != 0)
      return std::string();
    iconv(converter.get(), nullptr, nullptr, &out_pointer, &out_left);
    return std::string(out, out_pointer);
  };
}

bool is_private(uint32_t u) {
  return u >= 0xE000 && u <= 0xF8FF;
}

/// What the sign that is read back has to do with the one that was written.
std::string family(uint32_t written, uint32_t read) {
  const auto w = static_cast<UChar32>(written), r = static_cast<UChar32>(read);
  const auto form = [](UChar32 c) {
    UErrorCode status = U_ZERO_ERROR;
    const auto unit = static_cast<UChar>(c);
    return lexicor_import::icu_text("NFKC", [&](UChar* out, int32_t room, UErrorCode* error) {
      return unorm2_normalize(unorm2_getNFKCInstance(&status), &unit, 1, out, room, error);
    });
  };
  if (is_private(read)) return "private";
  if (u_charType(r) == U_CONTROL_CHAR) return "control";
  if (form(w) == form(r)) return "form";
  if (u_hasBinaryProperty(w, UCHAR_IDEOGRAPHIC) && u_hasBinaryProperty(r, UCHAR_IDEOGRAPHIC))
    return "ideograph";
  if (u_isalpha(w) && u_isalpha(r)) return "letter";
  return u_isdigit(w) && u_isdigit(r) ? "digit" : "sign";
}

/// Calls `visit(code)` for every character that the codepage's bytes can form: the first bytes of longer
/// characters with all second bytes, and of those that are longer still the ones that the source maps.
void for_each_code(const ShippedCodepage& codepage, const std::function<void(uint32_t)>& visit) {
  for (uint32_t b = 0; b <= 0xFF; ++b) {
    const bool shift_byte = codepage.shift() && (b == lexicor_data::kShiftOut || b == lexicor_data::kShiftIn);
    if (codepage.source.leads[b] == 1 && !shift_byte) visit(b);
    const bool leads = codepage.shift() ? b >= 0x40 && b <= 0xFE : codepage.source.leads[b] == 2;
    for (uint32_t c = codepage.shift() ? 0x40 : 0; leads && c <= 0xFF; ++c) visit(b << 8 | c);
  }
  for (const lexicor_data::Mapping& mapping : codepage.source.mappings)
    if (mapping.bytes > 2 && mapping.precision != 1 && mapping.unicode <= 0xFFFF) visit(mapping.code);
}

void compare(const ShippedCodepage& codepage, const std::string& peer_name, const Peer& peer,
             ListedDifferences* differences) {
  const std::string head = peer_name + " " + codepage.source.name;
  const auto value_of = [&](uint32_t code) {
    const uint32_t u = codepage.model.value_of(code);
    return u == lexicor_data::kNoValue ? kNone : u;
  };
  for_each_code(codepage, [&](uint32_t code) {
    const std::string text = codepage.text_of(code);
    const uint32_t ours = value_of(code), theirs = peer.to_unicode(text);
    if (ours == theirs) return;
    const char* kind = is_private(ours) || is_private(theirs) ? "private-use"
                       : ours == kNone                        ? "only-theirs"
                       : theirs == kNone                      ? "only-ours"
                                                              : "other-value";
    differences->add(head, std::string("to-unicode ") + kind,
                     testing::PrintToString(text) + ":" + testing::PrintToString(ours) + "/" +
                         testing::PrintToString(theirs));
  });
  for (uint32_t u = 0; u <= 0xFFFF; ++u) {
    if (u >= 0xD800 && u <= 0xDFFF) continue;
    const uint32_t code = codepage.model.from_unicode[u];
    const std::string ours = code != lexicor_data::kNoCode ? codepage.text_of(code) : "";
    const std::string theirs = peer.from_unicode(u);
    if (ours == theirs) continue;
    std::string place = head, kind = is_private(u) ? "private-use" : "other-bytes";
    if (!is_private(u) && ours.empty() != theirs.empty()) {
      const uint32_t read = ours.empty() ? peer.to_unicode(theirs) : value_of(code);
      kind = ours.empty() ? "only-theirs" : "only-ours";
      if (read != u && read != kNone) place = peer_name + " *", kind += "-" + family(u, read);
    }
    differences->add(place, "from-unicode " + kind,
                     codepage.source.name + " " + lexicor_cli::code_point_name(u) + ":" +
                         testing::PrintToString(ours) + "/" + testing::PrintToString(theirs));
  }
}

/// ICU's converter that a source was taken from: "ICU 72.1 NAME; ...".
std::string icu_name(const ShippedCodepage& codepage) {
  std::istringstream words(codepage.source.source);
  std::string icu, version, name;
  std::getline(words >> icu >> version >> std::ws, name, ';');
  return icu == "ICU" ? name : std::string();
}

/// glibc's charsets that a codepage may be: the listed one, or its own name and customary ones, CP and the number where
/// no multibyte table of another maker has that name.
std::vector<std::string> iconv_names(const ShippedCodepage& codepage) {
  const std::string& name = codepage.source.name;
  for (const CaseRow& row : case_rows("directory/iconv_names.txt"))
    if (row[0] == name) return {row[1]};
  const size_t digits = name.find_first_of("0123456789");
  if (codepage.source.width > 1 || digits == std::string::npos) return {name};
  return {name, "CP" + name.substr(digits)};
}

TEST(Peers, CodepagesConvertAsInIcuAndIconv) {
  ListedDifferences differences;
  size_t icu = 0, iconv = 0;
  for (const ShippedCodepage& codepage : shipped_codepages()) {
    if (const std::string name = codepage.source.utf8 ? "UTF-8" : icu_name(codepage); !name.empty()) {
      const Peer peer = icu_peer(name);
      ASSERT_TRUE(peer.decode) << codepage.source.name << ": no converter " << name;
      compare(codepage, "icu", peer, &differences);
      ++icu;
    }
    Peer peer;
    for (const std::string& name : iconv_names(codepage))
      if (!peer.decode) peer = {iconv_of("UCS-2LE", name), iconv_of(name, "UCS-2LE")};
    if (!peer.decode) continue;
    compare(codepage, "iconv", peer, &differences);
    ++iconv;
  }
  EXPECT_GE(icu, 140u) << "the others are taken from glibc";
  EXPECT_GE(iconv, 147u) << "glibc has fewer charsets than when this was written";
  differences.expect_listed("peer_differences.txt", 4, true);
}

}  // namespace
}  // namespace lx::test
