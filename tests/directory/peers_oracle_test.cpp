// Every shipped codepage against ICU's converter of the same name in the source, and against iconv where glibc
// has the charset: all characters of up to four bytes, and all 65,536 Unicode values. What differs is counted
// by codepage, direction and kind, and must be what peer_differences.txt lists, each line with its reason.
#include <gtest/gtest.h>
#include <iconv.h>
#include <unicode/uchar.h>
#include <unicode/ucnv.h>
#include <unicode/unorm2.h>

#include <functional>
#include <map>
#include <memory>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include "directory/directory_codepages.h"
#include "directory/icu_peer.h"
#include "directory/listed_differences.h"
#include "support/library.h"

namespace lx::test {
namespace {

constexpr uint32_t kNone = 0xFFFFFFFF;

/// A converter, character by character: kNone and an empty text where there is no mapping.
class Peer {
 public:
  virtual ~Peer() = default;
  virtual uint32_t to_unicode(const std::string& text) = 0;
  virtual std::string from_unicode(uint16_t u) = 0;
};

class IcuPeer : public Peer {
 public:
  explicit IcuPeer(const std::string& name) {
    UErrorCode status = U_ZERO_ERROR;
    converter_.reset(ucnv_open(name.c_str(), &status));
    if (U_FAILURE(status)) return;
    ucnv_setFallback(converter_.get(), 1);
    ucnv_setToUCallBack(converter_.get(), UCNV_TO_U_CALLBACK_STOP, nullptr, nullptr, nullptr, &status);
    ucnv_setFromUCallBack(converter_.get(), UCNV_FROM_U_CALLBACK_STOP, nullptr, nullptr, nullptr, &status);
  }
  bool usable() const { return converter_ != nullptr; }

  uint32_t to_unicode(const std::string& text) override {
    UErrorCode status = U_ZERO_ERROR;
    UChar units[8];
    ucnv_resetToUnicode(converter_.get());
    const int32_t n =
        ucnv_toUChars(converter_.get(), units, 8, text.data(), static_cast<int32_t>(text.size()), &status);
    if (U_FAILURE(status) || n == 0) return kNone;
    return n == 1 && units[0] != 0xFFFD ? units[0] : kNone;
  }

  std::string from_unicode(uint16_t u) override {
    UErrorCode status = U_ZERO_ERROR;
    char bytes[16];
    const UChar unit = u;
    ucnv_resetFromUnicode(converter_.get());
    const int32_t n = ucnv_fromUChars(converter_.get(), bytes, sizeof(bytes), &unit, 1, &status);
    return U_SUCCESS(status) ? std::string(bytes, static_cast<size_t>(n)) : std::string();
  }

 private:
  lexicor_import::IcuPtr<UConverter, ucnv_close> converter_;
};

class IconvPeer : public Peer {
 public:
  explicit IconvPeer(const std::string& name)
      : to_(iconv_open("UCS-2LE", name.c_str())), from_(iconv_open(name.c_str(), "UCS-2LE")) {}
  ~IconvPeer() override {
    if (to_ != kBad) iconv_close(to_);
    if (from_ != kBad) iconv_close(from_);
  }
  bool usable() const { return to_ != kBad && from_ != kBad; }

  uint32_t to_unicode(const std::string& text) override {
    const std::string units = run(to_, text);
    if (units.size() != 2) return kNone;
    const uint32_t u = static_cast<uint8_t>(units[0]) | static_cast<uint32_t>(static_cast<uint8_t>(units[1]))
                                                            << 8;
    return u != 0xFFFD ? u : kNone;
  }
  std::string from_unicode(uint16_t u) override {
    return run(from_, {static_cast<char>(u), static_cast<char>(u >> 8)});
  }

 private:
  static inline const iconv_t kBad = reinterpret_cast<iconv_t>(-1);

  static std::string run(iconv_t converter, std::string text) {
    char out[32];
    char* in_pointer = text.data();
    char* out_pointer = out;
    size_t in_left = text.size();
    size_t out_left = sizeof(out);
    iconv(converter, nullptr, nullptr, nullptr, nullptr);
    if (iconv(converter, &in_pointer, &in_left, &out_pointer, &out_left) != 0 || in_left != 0) return {};
    iconv(converter, nullptr, nullptr, &out_pointer, &out_left);
    return std::string(out, out_pointer);
  }

  iconv_t to_;
  iconv_t from_;
};

/// The library's own conversion, in the same shape.
class Library16 : public Peer {
 public:
  explicit Library16(const ShippedCodepage& codepage)
      : locale_(locale_with(codepage.source.name)),
        substitution_(1, static_cast<char>(codepage.source.substitution)) {
    if (codepage.source.utf8) substitutes_for_.insert(codepage.source.substitution);
    for (const lexicor_data::Mapping& mapping : codepage.source.mappings)
      if (mapping.precision != 3 && mapping.bytes == 1 && mapping.code == codepage.source.substitution)
        substitutes_for_.insert(mapping.unicode);
  }

  uint32_t to_unicode(const std::string& text) override {
    const Units units = test::to_unicode(locale_.get(), text);
    return units.size() == 1 && units[0] != 0xFFFD ? units[0] : kNone;
  }
  std::string from_unicode(uint16_t u) override {
    const std::string text = test::from_unicode(locale_.get(), {u});
    return text == substitution_ && substitutes_for_.count(u) == 0 ? std::string() : text;
  }

 private:
  LocalePtr locale_;
  std::string substitution_;
  std::set<uint32_t> substitutes_for_;
};

bool is_private(uint32_t u) {
  return u >= 0xE000 && u <= 0xF8FF;
}

/// What the sign that is read back has to do with the one that was written.
std::string family(uint32_t written, uint32_t read) {
  const auto w = static_cast<UChar32>(written), r = static_cast<UChar32>(read);
  const auto form = [](UChar32 c) {
    UErrorCode status = U_ZERO_ERROR;
    const auto unit = static_cast<UChar>(c);
    return icu([&](UChar* out, int32_t room, UErrorCode* error) {
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

std::string shown(uint32_t u) {
  char digits[12];
  snprintf(digits, sizeof(digits), "U+%04X", u);
  return u == kNone ? "none" : digits;
}
std::string shown(const std::string& bytes) {
  return testing::PrintToString(bytes);
}

/// Counts of differences by "peer codepage direction kind", with examples of each: "character:ours/theirs".
class Differences {
 public:
  template <class Value>
  void add(const std::string& line, const std::string& character, const Value& ours, const Value& theirs) {
    auto& [count, examples] = groups_[line];
    if (count++ < 6) examples += character + ":" + shown(ours) + "/" + shown(theirs) + " ";
  }
  void expect_listed() const {
    ListedDifferences all(5);
    for (const auto& [line, group] : groups_) all.add(line + " " + std::to_string(group.first), group.second);
    all.expect_listed("peer_differences.txt");
  }

 private:
  std::map<std::string, std::pair<size_t, std::string>> groups_;
};

/// Calls `visit(text)` for every character that the codepage's bytes can form: the first bytes of longer
/// characters with all second bytes, and of those that are longer still the ones that the source maps.
void for_each_text(const ShippedCodepage& codepage, const std::function<void(const std::string&)>& visit) {
  const auto byte = [](uint32_t b) { return static_cast<char>(b); };
  for (uint32_t b = 0; b <= 0xFF; ++b) {
    const bool shift_byte = codepage.shift() && (b == lexicor_data::kShiftOut || b == lexicor_data::kShiftIn);
    if (codepage.source.leads[b] == 1 && !shift_byte) visit(std::string(1, byte(b)));
    const bool leads = codepage.shift() ? b >= 0x40 && b <= 0xFE : codepage.source.leads[b] == 2;
    if (!leads) continue;
    for (uint32_t c = codepage.shift() ? 0x40 : 0; c <= 0xFF; ++c) visit(text_of_code(codepage, b << 8 | c, 2));
  }
  for (const lexicor_data::Mapping& mapping : codepage.source.mappings)
    if (mapping.bytes > 2 && mapping.precision != 1 && mapping.unicode <= 0xFFFF)
      visit(text_of_code(codepage, mapping.code, mapping.bytes));
}

void compare(const ShippedCodepage& codepage, const std::string& peer_name, Peer& peer,
             Differences* differences) {
  Library16 library(codepage);
  const std::string head = peer_name + " " + codepage.source.name + " ";
  for_each_text(codepage, [&](const std::string& text) {
    const uint32_t ours = library.to_unicode(text);
    const uint32_t theirs = peer.to_unicode(text);
    if (ours == theirs) return;
    const char* kind = is_private(ours) || is_private(theirs) ? "private-use"
                       : ours == kNone                        ? "only-theirs"
                       : theirs == kNone                      ? "only-ours"
                                                              : "other-value";
    differences->add(head + "to-unicode " + kind, shown(text), ours, theirs);
  });
  for (uint32_t u = 0; u <= 0xFFFF; ++u) {
    if (u >= 0xD800 && u <= 0xDFFF) continue;
    const std::string ours = library.from_unicode(static_cast<uint16_t>(u));
    const std::string theirs = peer.from_unicode(static_cast<uint16_t>(u));
    if (ours == theirs) continue;
    if (!is_private(u) && ours.empty() != theirs.empty()) {
      const uint32_t read = ours.empty() ? peer.to_unicode(theirs) : library.to_unicode(ours);
      const std::string side = ours.empty() ? "only-theirs" : "only-ours";
      const bool one_way = read != u && read != kNone;
      const std::string line = one_way ? peer_name + " * from-unicode " + side + "-" + family(u, read)
                                       : head + "from-unicode " + side;
      differences->add(line, codepage.source.name + " " + shown(u), ours, theirs);
    } else {
      const char* kind = is_private(u) ? "private-use" : "other-bytes";
      differences->add(head + "from-unicode " + kind, shown(u), ours, theirs);
    }
  }
}

/// ICU's converter that a source was taken from: "ICU 72.1 NAME; ...".
std::string icu_name(const ShippedCodepage& codepage) {
  std::istringstream words(codepage.source.source);
  std::string icu, version, name;
  words >> icu >> version >> name;
  while (!name.empty() && name.back() == ';') name.pop_back();
  return icu == "ICU" ? name : std::string();
}

/// glibc's charsets that a codepage may be: its own name and customary ones, CP and the number where no
/// multibyte table of another maker has that name.
std::vector<std::string> iconv_names(const ShippedCodepage& codepage) {
  static const std::map<std::string, std::string> others = {{"Latin1", "ISO-8859-1"},
                                                            {"IBM838", "IBM9030"},
                                                            {"IBM942", "IBM932"},
                                                            {"IBM1363", "UHC"},
                                                            {"IBM1386", "GBK"},
                                                            {"JapanEUC", "EUC-JP"},
                                                            {"MS932", "CP932"},
                                                            {"MS936", "CP936"},
                                                            {"MS949", "UHC"},
                                                            {"MS950", "BIG5"},
                                                            {"MacRoman", "MACINTOSH"},
                                                            {"MacCyrillic", "MAC-CYRILLIC"},
                                                            {"MacCentralEurope", "MAC-CENTRALEUROPE"}};
  const std::string& name = codepage.source.name;
  const auto known = others.find(name);
  if (known != others.end()) return {known->second};
  const size_t digits = name.find_first_of("0123456789");
  if (codepage.source.width > 1 || digits == std::string::npos) return {name};
  return {name, "CP" + name.substr(digits)};
}

TEST(Peers, CodepagesConvertAsInIcuAndIconv) {
  const Library library(LEXICOR_LOCALE_DIR);
  Differences differences;
  size_t icu = 0, iconv = 0;
  for (const ShippedCodepage& codepage : shipped_codepages()) {
    if (const std::string name = codepage.source.utf8 ? "UTF-8" : icu_name(codepage); !name.empty()) {
      IcuPeer peer(name);
      ASSERT_TRUE(peer.usable()) << codepage.source.name << ": no converter " << name;
      compare(codepage, "icu", peer, &differences);
      ++icu;
    }
    std::unique_ptr<IconvPeer> peer;
    for (const std::string& name : iconv_names(codepage))
      if (peer == nullptr || !peer->usable()) peer = std::make_unique<IconvPeer>(name);
    if (!peer->usable()) continue;
    compare(codepage, "iconv", *peer, &differences);
    ++iconv;
  }
  EXPECT_GE(icu, 140u) << "the others are taken from glibc";
  EXPECT_GE(iconv, 147u) << "glibc has fewer charsets than when this was written";
  differences.expect_listed();
}

}  // namespace
}  // namespace lx::test
