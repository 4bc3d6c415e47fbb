// Reader of codepage tables. Lines are read one by one, so that every error names its line and column, and all of them
// are said; what concerns the table as a whole (the base, lengths against leads, duplicates) is settled at the end, at
// the positions kept for each mapping.
#include "ucm.h"

#include <algorithm>
#include <istream>
#include <set>
#include <tuple>

#include "files.h"
#include "line_text.h"
#include "ucm_header.h"
#include "ucm_line.h"

namespace lexicor_data {
namespace {

constexpr uint32_t kLastCodePoint = 0x10FFFF;
constexpr size_t kMaxCodeBytes = 4;

std::string directory_of(const std::string& file) {
  const size_t slash = file.rfind('/');
  return slash == std::string::npos ? "" : file.substr(0, slash + 1);
}

/// A mapping of the base that the file takes back, and whether there was one.
struct TakenBack {
  Mapping mapping;
  Position place;
  bool found = false;
};

class UcmReader {
 public:
  /// `above` are the files that have this one as their base.
  UcmReader(std::istream& in, const std::string& file, std::vector<std::string> above)
      : in_(in), file_(file), above_(std::move(above)), header_(file_, source_) {}

  CodepageSource read() {
    read_lines();
    const bool is_sound = errors_.empty();
    if (header_is_sound_) settle();
    if (is_sound && place_ == Place::kHeader && !source_.utf8)
      errors_.add(SourceError(file_, line_ + 1, 1, "CHARMAP is missing"));
    if (is_sound && place_ == Place::kMappings)
      errors_.add(SourceError(file_, line_ + 1, 1, "END CHARMAP is missing"));
    errors_.sort(file_);
    errors_.throw_if_any();
    say_what_was_skipped();
    std::sort(source_.mappings.begin(), source_.mappings.end(), in_table_order);
    return std::move(source_);
  }

 private:
  enum class Place { kHeader, kMappings, kEnd };
  struct Places {
    Position unicode;
    Position code;
  };

  void read_lines() {
    std::string text;
    while (!errors_.full() && next_line(in_, &text, &line_)) {
      UcmLine line(file_, std::move(text), line_);
      line.skip_blanks();
      if (line.done()) continue;
      const bool in_header = place_ == Place::kHeader;
      if (!errors_.attempt([&] { read_line(line); }) && in_header) header_is_sound_ = false;
    }
    if (place_ == Place::kHeader) header_.end({line_ + 1, 1});
  }

  void read_line(UcmLine& line) {
    switch (place_) {
      case Place::kHeader:
        if (line.peek() == '<') return header_.read_key(line);
        if (!line.is_text("CHARMAP")) line.fail_expected("a key in angle brackets or CHARMAP");
        header_.end(line.here());
        place_ = Place::kMappings;
        return;
      case Place::kMappings:
        if (line.peek() == '<') return read_mapping(line);
        if (!line.is_text("END CHARMAP")) line.fail_expected("a mapping or END CHARMAP");
        place_ = Place::kEnd;
        return;
      case Place::kEnd:
        line.fail_expected("nothing after END CHARMAP");
    }
  }

  void read_mapping(UcmLine& line) {
    Mapping mapping;
    const Position start = line.here();
    mapping.unicode = code_point(line);
    const uint32_t last = line.take("..") ? code_point(line) : mapping.unicode;
    if (last < mapping.unicode) line.fail(start, "the range runs backwards");
    bool sequence = line.peek() == '<' || line.peek() == '+';
    while (line.take('+') || line.peek() == '<') code_point(line);
    if (!is_blank(line.peek())) line.fail_expected("a blank");
    line.skip_blanks();
    const Position code_start = line.here();
    size_t bytes = 0;
    do {
      if (line.take('+')) sequence = true;
      if (!sequence && bytes == kMaxCodeBytes) line.fail_expected("a blank after at most 4 bytes");
      mapping.code = mapping.code << 8 | line.byte();
      ++bytes;
    } while (line.peek() == '\\' || line.peek() == '+');
    mapping.bytes = static_cast<uint8_t>(bytes);
    if (!line.done() && !is_blank(line.peek())) line.fail_expected("a blank after at most 4 bytes");
    if (last - mapping.unicode > 0xFF - (mapping.code & 0xFF))
      line.fail(start, "the range goes on behind the last byte FF");
    line.skip_blanks();
    const char precision = read_precision(line);
    if (sequence) return skip(start);
    if (precision == '2') return;  // says which substitution stands for the character, which has none here
    if (precision == '-' && header_.base().empty())
      line.fail(start, "only a mapping of a base can be taken back");
    mapping.precision = static_cast<uint8_t>(precision == '4' ? 1 : precision - '0');
    for (;; ++mapping.unicode, ++mapping.code) {
      if (precision == '-') {
        taken_back_.push_back({mapping, start});
      } else {
        source_.mappings.push_back(mapping);
        places_.push_back({start, code_start});
      }
      if (mapping.unicode == last) return;
    }
  }

  uint32_t code_point(UcmLine& line) const {
    const Position start = line.here();
    line.expect('<', "a code point as <UXXXX>");
    line.expect('U', "a code point as <UXXXX>");
    const uint32_t unicode = line.hex_number(4, 6);
    line.expect('>', "the closing bracket of a code point of 4 to 6 digits");
    if (unicode > kLastCodePoint)
      line.fail(start, "code point " + unicode_text(unicode) + " lies above <U10FFFF>");
    return unicode;
  }

  /// Tables of other systems may have none where all mappings go both ways.
  static char read_precision(UcmLine& line) {
    if (line.done()) return '0';
    line.expect('|', "the precision");
    const char precision = line.peek();
    if (precision != '-' && (precision < '0' || precision > '4')) line.fail_expected("precision 0, 1, 3 or -");
    line.take(precision);
    line.expect_end();
    return precision;
  }

  void skip(Position where) {
    if (skipped_++ == 0) first_skipped_ = where;
  }

  void say_what_was_skipped() {
    if (skipped_ == 0) return;
    const std::string what =
        std::to_string(skipped_) + " mappings of several code points or characters are left out";
    source_.warnings.emplace_back(SourceError(file_, first_skipped_.line, first_skipped_.column, what).what());
  }

  void settle() {
    if (!errors_.attempt([&] { apply_base(); })) return;
    const bool had_errors = !errors_.empty();
    SourceErrors header_errors;
    header_.settle(header_errors);
    errors_.add_all(header_errors);
    if (!header_errors.empty()) return;
    if (source_.utf8 && place_ != Place::kHeader)
      errors_.attempt([&] { header_.fail("CHARMAP", "CHARMAP stands in a computed codepage"); });
    for (size_t i = 0; i < source_.mappings.size() && !errors_.full(); ++i)
      errors_.attempt([&] { check_length(source_.mappings[i], places_[i].code); });
    if (had_errors) return;
    drop_repeated();
    errors_.attempt([&] { check_mappings(); });
  }

  // -- the base -----------------------------------------------------------------------------------------------

  void apply_base() {
    if (header_.base().empty()) return;
    const CodepageSource base = read_base();
    header_.take_from(base);
    source_.bases.push_back(directory_of(file_) + header_.base() + ".ucm");
    source_.bases.insert(source_.bases.end(), base.bases.begin(), base.bases.end());
    std::set<uint32_t> values, codes;
    for (const Mapping& m : source_.mappings) {
      if (from_unicode(m)) values.insert(m.unicode);
      if (to_unicode(m)) codes.insert(m.code);
    }
    for (const Mapping& m : base.mappings) {
      if (is_taken_back(m)) continue;
      // A mapping of the file takes the place of those of the base that contradict it.
      if ((from_unicode(m) && values.count(m.unicode) != 0) || (to_unicode(m) && codes.count(m.code) != 0))
        continue;
      source_.mappings.push_back(m);
      places_.push_back({base_place(), base_place()});
    }
    for (const TakenBack& taken : taken_back_) {
      if (taken.found) continue;
      errors_.add(SourceError(file_, taken.place.line, taken.place.column,
                              "the base " + header_.base() + " has no mapping " +
                                  unicode_text(taken.mapping.unicode) + " " +
                                  code_text(taken.mapping.code, taken.mapping.bytes)));
    }
  }

  CodepageSource read_base() {
    const std::string path = directory_of(file_) + header_.base() + ".ucm";
    auto fail = [&](const std::string& what) {
      throw SourceError(file_, base_place().line, base_place().column, what);
    };
    std::vector<std::string> chain = above_;
    chain.push_back(file_);
    if (std::find(chain.begin(), chain.end(), path) != chain.end()) {
      std::string circle;
      for (auto at = std::find(chain.begin(), chain.end(), path); at != chain.end(); ++at) circle += *at + ", ";
      fail("the bases go round in a circle: " + circle + path);
    }
    std::istringstream in;
    try {
      in = open_source(path);
    } catch (const SourceError& error) {
      fail("the base " + path + ": " + error.fault);
    }
    CodepageSource base = UcmReader(in, path, std::move(chain)).read();
    if (base.utf8) fail("the base " + header_.base() + " is computed and has no mappings");
    return base;
  }

  Position base_place() const {
    const Position own = header_.place_of("base");
    const Position foreign = header_.place_of("icu:base");
    return own.line < foreign.line ? own : foreign;  // the one that is missing counts as the end of the header
  }

  bool is_taken_back(const Mapping& mapping) {
    bool taken = false;
    for (TakenBack& entry : taken_back_) {
      if (entry.mapping.unicode != mapping.unicode || entry.mapping.code != mapping.code) continue;
      entry.found = taken = true;
    }
    return taken;
  }

  // -- checks -------------------------------------------------------------------------------------------------

  void check_length(const Mapping& mapping, Position where) const {
    const uint32_t first = mapping.code >> (8 * (mapping.bytes - 1));
    const std::string code = code_text(mapping.code, mapping.bytes);
    auto fail = [&](const std::string& what) { throw SourceError(file_, where.line, where.column, what); };
    if (source_.kind == CodepageClass::kShiftStateful) {
      if (mapping.bytes != 1 && mapping.bytes != source_.width)
        fail("code " + code + " has " + std::to_string(mapping.bytes) + " bytes, expected 1 or " +
             std::to_string(source_.width));
      if (mapping.bytes == 1 && (first == kShiftOut || first == kShiftIn))
        fail(code + " is a shift byte and carries no character");
    } else if (mapping.bytes != source_.leads[first]) {
      fail("code " + code + " has " + std::to_string(mapping.bytes) +
           (mapping.bytes == 1 ? " byte, but " : " bytes, but ") + byte_text(first) + " begins characters of " +
           std::to_string(source_.leads[first]));
    }
    if (mapping.bytes > 1 && first == 0) fail("code " + code + " begins with a zero byte");
  }

  /// A mapping that stands twice is one.
  void drop_repeated() {
    std::set<std::tuple<uint32_t, uint32_t, uint8_t>> seen;
    std::vector<Mapping> mappings;
    std::vector<Places> places;
    for (size_t i = 0; i < source_.mappings.size(); ++i) {
      const Mapping& m = source_.mappings[i];
      if (!seen.emplace(m.unicode, m.code, m.precision).second) continue;
      mappings.push_back(m);
      places.push_back(places_[i]);
    }
    source_.mappings = std::move(mappings);
    places_ = std::move(places);
  }

  /// No code means two characters, and no character has two codes. The first offending line is reported.
  void check_mappings() const {
    std::vector<size_t> order;
    auto refuse = [&](auto concerns, uint32_t Mapping::*field, auto text, auto place) {
      order.clear();
      for (size_t i = 0; i < source_.mappings.size(); ++i) {
        if (concerns(source_.mappings[i])) order.push_back(i);
      }
      std::sort(order.begin(), order.end(), [&](size_t a, size_t b) {
        const uint32_t x = source_.mappings[a].*field, y = source_.mappings[b].*field;
        return x != y ? x < y : a < b;
      });
      size_t worst = SIZE_MAX, earlier = 0;
      for (size_t i = 1; i < order.size(); ++i) {
        const bool same = source_.mappings[order[i]].*field == source_.mappings[order[i - 1]].*field;
        if (same && order[i] < worst) worst = order[i], earlier = order[i - 1];
      }
      if (worst == SIZE_MAX) return;
      const Position where = place(places_[worst]);
      throw SourceError(file_, where.line, where.column,
                        text(source_.mappings[worst]) + " is mapped on line " +
                            std::to_string(places_[earlier].unicode.line) + " already");
    };
    refuse(
        to_unicode, &Mapping::code, [](const Mapping& m) { return "code " + code_text(m.code, m.bytes); },
        [](const Places& p) { return p.code; });
    refuse(
        from_unicode, &Mapping::unicode,
        [](const Mapping& m) { return "code point " + unicode_text(m.unicode); },
        [](const Places& p) { return p.unicode; });
  }

  std::istream& in_;
  const std::string file_;
  const std::vector<std::string> above_;
  int line_ = 0;
  Place place_ = Place::kHeader;
  bool header_is_sound_ = true;
  CodepageSource source_;
  UcmHeader header_;
  std::vector<Places> places_;  ///< of source_.mappings, in the order of reading
  std::vector<TakenBack> taken_back_;
  size_t skipped_ = 0;
  Position first_skipped_;
  SourceErrors errors_;
};

}  // namespace

bool in_table_order(const Mapping& a, const Mapping& b) {
  return std::tie(a.unicode, a.precision, a.code) < std::tie(b.unicode, b.precision, b.code);
}

CodepageSource read_ucm(std::istream& in, const std::string& file_name) {
  return UcmReader(in, file_name, {}).read();
}

CodepageSource read_ucm_file(const std::string& path) {
  std::istringstream in = open_source(path);
  return read_ucm(in, path);
}

}  // namespace lexicor_data
