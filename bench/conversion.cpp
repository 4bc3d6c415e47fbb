// Conversion beside ICU, iconv and libunistring. Each library is called as a program would that converts much:
// converters stay open, and a string is one call that begins in the initial state.
#include <algorithm>
#include <map>

#include "codepages.h"
#include "families.h"
#include "icu.h"

namespace bench {
namespace {

constexpr size_t kLongBytes = 1000000;
constexpr size_t kShortBytes = 24;

/// Conversions to and from these: UTF-16 each, and UTF-8 where it is not the codepage itself.
struct Subject {
  const char* codepage;
  std::vector<const char*> texts;
};
const Subject kSubjects[] = {
    {"UTF-8",
     {"Russian",       "Greek",       "Thai",          "Chinese",         "Taiwan",         "Korean",
      "Japanese",      "French",      "German",        "Czech",           "Swedish",        "English",
      "Russian-prose", "Greek-prose", "Chinese-prose", "Korean-prose",    "Japanese-prose", "French-prose",
      "German-prose",  "Czech-prose", "English-prose", "sparse-Japanese", "ASCII"}},
    {"Latin1", {"German", "French", "German-prose", "sparse-German", "ASCII"}},
    {"MS1251", {"Russian", "Russian-prose", "sparse-Russian"}},
    {"MS1253", {"Greek"}},
    {"MS874", {"Thai"}},
    {"MS932", {"Japanese", "Japanese-prose", "sparse-Japanese", "ASCII"}},
    {"JapanEUC", {"Japanese", "Japanese-prose"}},
    {"MS936", {"Chinese", "Chinese-prose"}},
    {"MS949", {"Korean", "Korean-prose"}},
    {"MS950", {"Taiwan", "Taiwan-prose"}},
    {"IBM930", {"Japanese", "Japanese-prose", "sparse-Japanese"}},
    {"IBM939", {"Japanese"}},
};

/// Between two codepages, in both directions.
struct Pair {
  const char *one, *other, *text;
};
constexpr Pair kPairs[] = {
    {"Latin1", "IBM1141", "German"}, {"MS1251", "KOI8-R", "Russian"}, {"MS932", "JapanEUC", "Japanese"},
    {"MS932", "IBM930", "Japanese"}, {"MS932", "IBM939", "Japanese"}, {"MS949", "EUC-KR", "Korean"},
};

/// The library's own calls.
Work convert(const Input& input, const Codepage& from, const Codepage& to) {
  const Encoding &source = from.encoding(), &target = to.encoding();
  LXLocale *const in_locale = from.locale(), *const out_locale = to.locale();
  if (is_utf16(target)) {
    if (source.is_stateful)
      return for_each_piece(input, [in_locale](const char* in, size_t bytes, char* out) {
        return 2 * count(LXStringToUnicodeEx(reinterpret_cast<LXUChar*>(out), length(bytes), in_locale, in,
                                             LX_SHIFT_SINGLE, length(bytes), 0));
      });
    return for_each_piece(input, [in_locale](const char* in, size_t bytes, char* out) {
      return 2 * count(LXStringToUnicode(reinterpret_cast<LXUChar*>(out), length(bytes), in_locale, in,
                                         length(bytes), 0));
    });
  }
  if (is_utf16(source)) {
    if (target.is_stateful)
      return for_each_piece(input, [out_locale](const char* in, size_t bytes, char* out) {
        return count(LXUnicodeToStringEx(out_locale, out, LX_SHIFT_SINGLE, length(2 * bytes),
                                         reinterpret_cast<const LXUChar*>(in), length(bytes / 2), 0));
      });
    return for_each_piece(input, [out_locale](const char* in, size_t bytes, char* out) {
      return count(LXUnicodeToString(out_locale, out, length(2 * bytes), reinterpret_cast<const LXUChar*>(in),
                                     length(bytes / 2), 0));
    });
  }
  if (source.is_stateful || target.is_stateful)
    return for_each_piece(input, [in_locale, out_locale](const char* in, size_t bytes, char* out) {
      return count(LXConvertStringEx(out_locale, out, LX_SHIFT_SINGLE, length(6 * bytes + 8), in_locale, in,
                                     LX_SHIFT_SINGLE, length(bytes), 0));
    });
  return for_each_piece(input, [in_locale, out_locale](const char* in, size_t bytes, char* out) {
    return count(LXConvertString(out_locale, out, length(6 * bytes + 8), in_locale, in, length(bytes), 0));
  });
}

/// The same as a stream, for the long text.
Work convert_stream(const Input& input, const Codepage& from, const Codepage& to) {
  const std::shared_ptr<LXConversion> conversion(LXOpenConversion(to.locale(), from.locale()),
                                                 LXCloseConversion);
  return for_each_piece(input, [conversion](const char* in, size_t bytes, char* out) {
    char* end = out;
    int32_t out_left = length(6 * bytes + 8), in_left = length(bytes);
    LXConvertBuffer(conversion.get(), &end, &out_left, &in, &in_left);
    return static_cast<size_t>(end - out);
  });
}

Work iconv_peer(const Input& input, const Encoding& from, const Encoding& to) {
  const std::shared_ptr<void> descriptor(iconv_open(to.iconv, from.iconv), iconv_close);
  return for_each_piece(input, [descriptor](const char* in, size_t bytes, char* out) {
    return run_iconv(descriptor.get(), in, bytes, out, 6 * bytes + 8);
  });
}

/// Shift-sensitive text ends in the single-byte state, as whole texts do.
std::u16string closed(const std::u16string& text, const Codepage& measure) {
  return measure.encoding().is_stateful ? text + u'.' : text;
}

/// A text of a million bytes in the codepage.
Input long_piece(const Codepage& measure, const Codepage& from, const std::u16string& text) {
  auto pieces = std::make_shared<Pieces>();
  const size_t bytes = measure.encode(text).size();
  pieces->chars =
      static_cast<size_t>(std::min<uint64_t>(text.size(), uint64_t{text.size()} * kLongBytes / bytes));
  pieces->bytes = from.encode(closed(text.substr(0, pieces->chars), measure));
  pieces->ends = {pieces->bytes.size()};
  return pieces;
}

/// Strings of at most kShortBytes bytes in the codepage.
Input short_pieces(const Codepage& measure, const Codepage& from, const std::u16string& text) {
  auto pieces = std::make_shared<Pieces>();
  size_t start = 0;
  while (pieces->ends.size() < kManyPieces && start < text.size()) {
    size_t chars = 1;
    const auto fits = [&](size_t n) {
      return measure.encode(closed(text.substr(start, n), measure)).size() <= kShortBytes;
    };
    while (start + chars < text.size() && fits(chars + 1)) ++chars;
    pieces->bytes += from.encode(closed(text.substr(start, chars), measure));
    pieces->ends.push_back(pieces->bytes.size());
    pieces->chars += chars;
    start += chars;
  }
  return pieces;
}

class ConversionRows {
 public:
  ConversionRows(Table* table, Texts* texts) : table_(*table), texts_(*texts) {}

  /// The rows of one direction. Sizes are those of the text in the codepage that is no Unicode.
  void add(const char* from_label, const char* to_label, const std::string& text) {
    const std::string stem = std::string("convert/") + from_label + "/" + to_label + "/" + text;
    const bool both_sizes = text.find("-prose") == std::string::npos;
    if (!table_.wants(stem + "/1MB") && !table_.wants(stem + "/24B") && !table_.wants(stem + "/stream")) return;
    const Codepage *const from = codepage(from_label), *const to = codepage(to_label);
    if (from == nullptr || to == nullptr) return;
    const std::u16string& whole = texts_.find(text);
    if (whole.empty()) return;
    const std::u16string units = agreed_text(whole, {from, to});
    const bool from_unicode =
        is_utf16(from->encoding()) || (is_utf8(from->encoding()) && !is_utf16(to->encoding()));
    const Codepage& measure = to->encoding().is_stateful || from_unicode ? *to : *from;
    add_row(stem + "/1MB", long_piece(measure, *from, units), *from, *to, convert);
    if (both_sizes) add_row(stem + "/24B", short_pieces(measure, *from, units), *from, *to, convert);
    if (from->locale() != nullptr && to->locale() != nullptr && text == "Japanese")
      add_row(stem + "/stream", long_piece(measure, *from, units), *from, *to, convert_stream);
  }

 private:
  template <class Ours>
  void add_row(const std::string& name, const Input& input, const Codepage& from, const Codepage& to,
               Ours ours) {
    if (!table_.wants(name)) return;
    const Encoding &source = from.encoding(), &target = to.encoding();
    table_.add({name,
                {{kOurs, ours(input, from, to)},
                 {kIcu, icu::convert(input, source, target)},
                 {"icu u_str", icu::convert_utf(input, source, target)},
                 {kIconv, iconv_peer(input, source, target)},
                 {kUnistring, unistring::convert(input, source, target)}},
                input->chars,
                input->ends.size(),
                6 * input->bytes.size() + 64});
  }

  const Codepage* codepage(const char* label) {
    const auto [place, is_new] = codepages_.try_emplace(label, nullptr);
    if (is_new) place->second = Codepage::open(*find_encoding(label));
    return place->second.get();
  }

  Table& table_;
  Texts& texts_;
  std::map<std::string, std::shared_ptr<const Codepage>> codepages_;
};

}  // namespace

void add_conversion_rows(Table* table, Texts* texts) {
  ConversionRows rows(table, texts);
  for (const Subject& subject : kSubjects) {
    const bool is_unicode = is_utf8(*find_encoding(subject.codepage));
    for (const char* const text : subject.texts) {
      for (const char* const unicode : {"UTF-16", "UTF-8"}) {
        if (is_unicode && is_utf8(*find_encoding(unicode))) continue;
        rows.add(subject.codepage, unicode, text);
        rows.add(unicode, subject.codepage, text);
      }
    }
  }
  for (const Pair& pair : kPairs) {
    rows.add(pair.one, pair.other, pair.text);
    rows.add(pair.other, pair.one, pair.text);
  }
}

}  // namespace bench
