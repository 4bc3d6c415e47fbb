// Case mapping of 16-bit Unicode and of UTF-8, beside ICU. Both use the language's special mappings.
#include <unicode/ucasemap.h>
#include <unicode/ustring.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "rows.h"

namespace bench {
namespace {

constexpr size_t kLongBytes = 1000000;
constexpr size_t kShortChars = 24;
constexpr size_t kShortStrings = 500;

struct Text {
  const char* label;
  Language language;
  Mixture mixture;
  const char* locale;
  const char* icu;
};
constexpr Text kTexts[] = {
    {"ASCII", Language::kGerman, Mixture::kAscii, "English.UTF-8", "en"},
    {"German", Language::kGerman, Mixture::kNative, "German.UTF-8", "de"},
    {"Russian", Language::kRussian, Mixture::kNative, "Russian.UTF-8", "ru"},
    {"Japanese", Language::kJapanese, Mixture::kNative, "Japanese.UTF-8", "ja"},
};

/// The text in one piece, or cut into short strings.
std::shared_ptr<const Pieces> pieces_of(const std::u16string& text, bool short_strings, bool utf8) {
  auto pieces = std::make_shared<Pieces>();
  const size_t step = short_strings ? kShortChars : text.size();
  for (size_t at = 0; at < text.size() && pieces->ends.size() < kShortStrings; at += step) {
    const std::u16string piece = text.substr(at, step);
    pieces->bytes +=
        utf8 ? to_utf8(piece)
             : std::string(reinterpret_cast<const char*>(piece.data()), piece.size() * sizeof(char16_t));
    pieces->ends.push_back(pieces->bytes.size());
    pieces->chars += piece.size();
  }
  return pieces;
}

/// Calls `map(input, bytes, output)`, which returns the bytes written, for every piece.
template <class Map>
Peer peer(const char* name, const std::shared_ptr<const Pieces>& pieces, Map map) {
  return {name, [pieces, map](char* output) {
            char* out = output;
            size_t start = 0;
            for (const size_t end : pieces->ends) {
              out += map(pieces->bytes.data() + start, end - start, out);
              start = end;
            }
            return static_cast<size_t>(out - output);
          }};
}

void add_row(std::vector<Row>* rows, Row row) {
  std::vector<char> ours(8 * row.input->bytes.size()), theirs(ours.size());
  const size_t bytes = row.peers[0].run(ours.data());
  if (row.peers[1].run(theirs.data()) != bytes || memcmp(ours.data(), theirs.data(), bytes) != 0) {
    std::fprintf(stderr, "%s: ICU maps to another text\n", row.name.c_str());
    std::exit(1);
  }
  row.output_room = ours.size();
  rows->push_back(std::move(row));
}

}  // namespace

void add_mapping_rows(std::vector<Row>* rows, const std::string& filter) {
  for (const Text& text : kTexts) {
    const std::u16string units = make_text(text.language, text.mixture, utf8_bytes, kLongBytes);
    for (const bool short_strings : {false, true}) {
      for (const bool utf8 : {false, true}) {
        const std::string name = std::string("map/") + text.label + (utf8 ? "/upper_utf8" : "/upper_utf16") +
                                 (short_strings ? "/24" : "/1MB");
        if (name.find(filter) == std::string::npos) continue;
        const std::shared_ptr<LXLocale> locale(LXGetLocale(text.locale, 0, nullptr), LXReleaseLocale);
        if (locale == nullptr) continue;
        Row row{name, pieces_of(units, short_strings, utf8), {}, 0};
        if (utf8) {
          UErrorCode error = U_ZERO_ERROR;
          const std::shared_ptr<UCaseMap> map(ucasemap_open(text.icu, 0, &error), ucasemap_close);
          row.peers.push_back(peer(kOurs, row.input, [locale](const char* in, size_t bytes, char* out) {
            return static_cast<size_t>(LXMapString(locale.get(), out, static_cast<int32_t>(2 * bytes), in,
                                                   static_cast<int32_t>(bytes), LX_MAP_UPPER));
          }));
          row.peers.push_back(peer(kIcu, row.input, [map](const char* in, size_t bytes, char* out) {
            UErrorCode failed = U_ZERO_ERROR;
            return static_cast<size_t>(ucasemap_utf8ToUpper(map.get(), out, static_cast<int32_t>(2 * bytes), in,
                                                            static_cast<int32_t>(bytes), &failed));
          }));
        } else {
          row.peers.push_back(peer(kOurs, row.input, [locale](const char* in, size_t bytes, char* out) {
            return 2 * static_cast<size_t>(LXMapStringU(locale.get(), reinterpret_cast<LXUChar*>(out),
                                                        static_cast<int32_t>(bytes),
                                                        reinterpret_cast<const LXUChar*>(in),
                                                        static_cast<int32_t>(bytes / 2), LX_MAP_UPPER));
          }));
          row.peers.push_back(peer(kIcu, row.input, [icu = text.icu](const char* in, size_t bytes, char* out) {
            UErrorCode failed = U_ZERO_ERROR;
            return 2 * static_cast<size_t>(u_strToUpper(reinterpret_cast<char16_t*>(out),
                                                        static_cast<int32_t>(bytes),
                                                        reinterpret_cast<const char16_t*>(in),
                                                        static_cast<int32_t>(bytes / 2), icu, &failed));
          }));
        }
        add_row(rows, std::move(row));
      }
    }
  }
}

}  // namespace bench
