// Each library is called as a program would that converts much: converters stay open, a string is one call that
// begins in the initial state.
#include "rows.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <map>

namespace bench {
namespace {

constexpr size_t kLongBytes = 1000000;
constexpr size_t kShortBytes = 24;
constexpr size_t kShortTextBytes = 12000;  // 500 short strings stay in the first-level cache
constexpr int32_t kPivotUnits = 1024;      // the size that ICU itself takes in ucnv_convert

enum class Size { kLong, kShort };

[[noreturn]] void stop(const std::string& row, const char* peer, const char* what) {
  std::fprintf(stderr, "%s: %s %s\n", row.c_str(), peer, what);
  std::exit(1);
}

/// Calls `convert(input, input_bytes, output)`, which returns the bytes written, for every piece.
template <class Convert>
size_t for_each_piece(const Pieces& pieces, char* output, Convert&& convert) {
  const char* const input = pieces.bytes.data();
  char* out = output;
  size_t start = 0;
  for (const size_t end : pieces.ends) {
    out += convert(input + start, end - start, out);
    start = end;
  }
  return static_cast<size_t>(out - output);
}

int32_t length(size_t n) {
  return static_cast<int32_t>(n);
}

/// The text as pieces: one, or strings of at most kShortBytes bytes in the codepage.
std::vector<std::u16string> split(const Codepage& codepage, const std::u16string& text, Size size) {
  if (size == Size::kLong) return {text};
  std::vector<std::u16string> strings;
  std::u16string current;
  for (const char16_t c : text) {
    if (codepage.encode(current + c + u'.').size() > kShortBytes) {
      strings.push_back(current + u'.');
      current.clear();
    }
    current.push_back(c);
  }
  return strings;
}

using Encode = std::function<std::string(const std::u16string&)>;

std::shared_ptr<const Pieces> join(const std::vector<std::u16string>& strings, const Encode& encode) {
  auto pieces = std::make_shared<Pieces>();
  for (const std::u16string& string : strings) {
    pieces->bytes += encode(string);
    pieces->ends.push_back(pieces->bytes.size());
    pieces->chars += string.size();
  }
  return pieces;
}

std::string utf16_bytes(const std::u16string& text) {
  return std::string(reinterpret_cast<const char*>(text.data()), text.size() * sizeof(char16_t));
}

/// What a row's peers write into, at most: 4 bytes a character, a shift byte on either side, a terminator.
size_t room_for(const Pieces& pieces) {
  return 6 * pieces.chars + 64;
}

class RowMaker {
 public:
  RowMaker(std::vector<Row>* rows, const std::string& filter) : rows_(rows), filter_(filter) {}

  void start(std::string name, std::shared_ptr<const Pieces> input) {
    wanted_ = name.find(filter_) != std::string::npos;
    row_ = {std::move(name), std::move(input), {}, 0};
  }

  /// Adds a peer with `convert(input, input_bytes, output)`.
  template <class Convert>
  void peer(const char* name, Convert convert) {
    if (!wanted_) return;
    row_.peers.push_back({name, [input = row_.input, convert](char* output) {
                            return for_each_piece(*input, output, convert);
                          }});
  }

  void iconv_peer(iconv_t descriptor) {
    peer(kIconv, [descriptor](const char* in, size_t bytes, char* out) {
      char* end = out;
      size_t room = 6 * bytes + 8;
      return run_iconv(descriptor, in, bytes, &end, &room) ? static_cast<size_t>(end - out) : 0;
    });
  }

  void finish() {
    if (!wanted_) return;
    peer(kMemcpy, [](const char* in, size_t bytes, char* out) {
      memcpy(out, in, bytes);
      return bytes;
    });
    check();
    rows_->push_back(std::move(row_));
  }

 private:
  /// All but memcpy must write the same bytes.
  void check() {
    std::vector<char> expected(room_for(*row_.input)), output(expected.size());
    row_.output_room = row_.peers.front().run(expected.data());
    if (row_.output_room == 0) stop(row_.name, kOurs, "writes nothing");
    for (const Peer& peer : row_.peers) {
      if (peer.name == kMemcpy) continue;
      const size_t bytes = peer.run(output.data());
      if (bytes != row_.output_room || memcmp(output.data(), expected.data(), bytes) != 0)
        stop(row_.name, peer.name, "writes other bytes");
    }
  }

  std::vector<Row>* rows_;
  const std::string& filter_;
  bool wanted_ = false;
  Row row_{};
};

void add_to_utf16(RowMaker& make, const Codepage& cp) {
  LXLocale* const locale = cp.locale();
  if (cp.name().stateful) {
    make.peer(kOurs, [locale](const char* in, size_t bytes, char* out) {
      return 2 * static_cast<size_t>(LXStringToUnicodeEx(reinterpret_cast<LXUChar*>(out), length(bytes), locale,
                                                         in, LX_SHIFT_SINGLE, length(bytes), 0));
    });
  } else {
    make.peer(kOurs, [locale](const char* in, size_t bytes, char* out) {
      return 2 * static_cast<size_t>(LXStringToUnicode(reinterpret_cast<LXUChar*>(out), length(bytes), locale,
                                                       in, length(bytes), 0));
    });
  }
  make.peer(kIcu, [icu = cp.icu()](const char* in, size_t bytes, char* out) {
    UErrorCode error = U_ZERO_ERROR;
    return 2 * static_cast<size_t>(ucnv_toUChars(icu, reinterpret_cast<char16_t*>(out), length(bytes) + 1, in,
                                                 length(bytes), &error));
  });
  make.iconv_peer(cp.to_utf16());
  make.finish();
}

void add_from_utf16(RowMaker& make, const Codepage& cp) {
  LXLocale* const locale = cp.locale();
  if (cp.name().stateful) {
    make.peer(kOurs, [locale](const char* in, size_t bytes, char* out) {
      return static_cast<size_t>(LXUnicodeToStringEx(locale, out, LX_SHIFT_SINGLE, length(2 * bytes),
                                                     reinterpret_cast<const LXUChar*>(in), length(bytes / 2),
                                                     0));
    });
  } else {
    make.peer(kOurs, [locale](const char* in, size_t bytes, char* out) {
      return static_cast<size_t>(LXUnicodeToString(locale, out, length(2 * bytes),
                                                   reinterpret_cast<const LXUChar*>(in), length(bytes / 2), 0));
    });
  }
  make.peer(kIcu, [icu = cp.icu()](const char* in, size_t bytes, char* out) {
    UErrorCode error = U_ZERO_ERROR;
    return static_cast<size_t>(ucnv_fromUChars(
        icu, out, length(2 * bytes) + 1, reinterpret_cast<const char16_t*>(in), length(bytes / 2), &error));
  });
  make.iconv_peer(cp.from_utf16());
  make.finish();
}

/// Between two codepages: with LXConvertString, and for a long text as a stream too.
void add_convert(RowMaker& make, const std::string& name, const std::shared_ptr<const Pieces>& input,
                 const Codepage& from, const Codepage& to, iconv_t descriptor, bool stream) {
  make.start(name, input);
  LXLocale *const source = from.locale(), *const target = to.locale();
  if (stream) {
    std::shared_ptr<LXConversion> conversion(LXOpenConversion(target, source), LXCloseConversion);
    make.peer(kOurs, [conversion](const char* in, size_t bytes, char* out) {
      char* end = out;
      int32_t out_left = length(6 * bytes + 8), in_left = length(bytes);
      LXConvertBuffer(conversion.get(), &end, &out_left, &in, &in_left);
      return static_cast<size_t>(end - out);
    });
  } else if (from.name().stateful || to.name().stateful) {
    make.peer(kOurs, [source, target](const char* in, size_t bytes, char* out) {
      return static_cast<size_t>(LXConvertStringEx(target, out, LX_SHIFT_SINGLE, length(6 * bytes + 8), source,
                                                   in, LX_SHIFT_SINGLE, length(bytes), 0));
    });
  } else {
    make.peer(kOurs, [source, target](const char* in, size_t bytes, char* out) {
      return static_cast<size_t>(
          LXConvertString(target, out, length(6 * bytes + 8), source, in, length(bytes), 0));
    });
  }
  make.peer(kIcu, [source_icu = from.icu(), target_icu = to.icu()](const char* in, size_t bytes, char* out) {
    char16_t pivot[kPivotUnits];
    char16_t *pivot_source = pivot, *pivot_target = pivot;
    char* end = out;
    UErrorCode error = U_ZERO_ERROR;
    ucnv_convertEx(target_icu, source_icu, &end, out + 6 * bytes + 8, &in, in + bytes, pivot, &pivot_source,
                   &pivot_target, pivot + kPivotUnits, true, true, &error);
    return static_cast<size_t>(end - out);
  });
  make.iconv_peer(descriptor);
  make.finish();
}

const char* text_label(Language language, Mixture mixture) {
  constexpr const char* kLanguages[] = {"German", "Russian", "Japanese", "Chinese"};
  if (mixture == Mixture::kAscii) return "ASCII";
  return mixture == Mixture::kSparse ? "sparse" : kLanguages[static_cast<size_t>(language)];
}

void add_text(RowMaker& make, const Codepage& cp, const Codepage& utf8, Language language, Mixture mixture,
              Size size) {
  const bool is_long = size == Size::kLong;
  std::map<char16_t, size_t> known;
  const CharBytes char_bytes = [&](char16_t c) {
    const auto [place, is_new] = known.try_emplace(c, 0);
    if (is_new) place->second = cp.agreed_bytes(c);
    return place->second;
  };
  const std::u16string text = make_text(language, mixture, char_bytes, is_long ? kLongBytes : kShortTextBytes);
  const std::vector<std::u16string> strings = split(cp, text, size);
  const auto encoded = join(strings, [&cp](const std::u16string& s) { return cp.encode(s); });
  const std::string stem = std::string(cp.name().label) + "/" + text_label(language, mixture) + "/";
  const std::string end = is_long ? "/1MB" : "/24B";

  make.start(stem + "to_utf16" + end, encoded);
  add_to_utf16(make, cp);
  make.start(stem + "from_utf16" + end, join(strings, utf16_bytes));
  add_from_utf16(make, cp);
  if (cp.is_utf8()) return;
  const auto encoded_utf8 = join(strings, [&utf8](const std::u16string& s) { return utf8.encode(s); });
  for (const bool stream : {false, true}) {
    if (stream && !is_long) continue;
    const std::string form = stream ? "/stream" : end;
    add_convert(make, stem + "to_utf8" + form, encoded, cp, utf8, cp.to_utf8(), stream);
    add_convert(make, stem + "from_utf8" + form, encoded_utf8, utf8, cp, cp.from_utf8(), stream);
  }
}

}  // namespace

std::vector<Row> make_rows(const std::vector<std::unique_ptr<Codepage>>& codepages, const std::string& filter) {
  std::vector<Row> rows;
  RowMaker make(&rows, filter);
  const Codepage& utf8 = *codepages.back();
  for (const Size size : {Size::kLong, Size::kShort}) {
    for (const auto& cp : codepages) {
      for (const Language language : cp->name().languages) {
        add_text(make, *cp, utf8, language, Mixture::kNative, size);
        if (language != cp->name().languages.front()) continue;
        add_text(make, *cp, utf8, language, Mixture::kSparse, size);
        add_text(make, *cp, utf8, language, Mixture::kAscii, size);
      }
    }
  }
  return rows;
}

}  // namespace bench
