// lexicor map: maps a text to another case or width, or its digits to ASCII digits, as a stream.
#include <lx.h>

#include <algorithm>
#include <map>
#include <memory>

#include "arguments.h"
#include "catalogue.h"
#include "codepage.h"
#include "command.h"
#include "hex.h"
#include "input.h"
#include "locale.h"
#include "malformed.h"
#include "output.h"
#include "pieces.h"
#include "repertoire.h"
#include "session.h"

namespace lexicor_cli {

namespace {

// A byte becomes at most two characters of four bytes, each with a shift byte before it.
constexpr size_t kGrowth = 10;
// Enough for several characters: among them a place is looked for where the text can be cut.
constexpr size_t kTailBytes = 64;
// Selectors of LXLangGetSpecial.
constexpr int32_t kSpecialUpper = 44;
constexpr int32_t kSpecialLower = 45;

struct Mapping {
  uint32_t mode;
  int32_t special;  // selector of the language's mappings that it applies, some of them to two characters; or 0
};

const std::map<std::string, Mapping> kMappings = {{"upper", {LX_MAP_UPPER, kSpecialUpper}},
                                                  {"lower", {LX_MAP_LOWER, kSpecialLower}},
                                                  {"full", {LX_MAP_FULL_WIDTH, 0}},
                                                  {"half", {LX_MAP_HALF_WIDTH, 0}},
                                                  {"digits", {LX_MAP_DIGITS, 0}}};

struct MapOptions {
  std::string mapping;
  std::string locale;  // empty: the user's
  std::string codepage = "UTF-8";
  std::string output = "-";
  std::vector<std::string> files;
};

/// The object of a locale's language.
const LXObject* language_object(const std::string& name) {
  int32_t code = LX_OK;
  return LXGetObjFromName(nullptr, LX_LANGUAGE, name.c_str(), static_cast<int32_t>(name.size()),
                          LX_FIND_AND_LOAD, &code);
}

/// Counts the characters whose own mapping in the language has letters that the codepage lacks: the library
/// puts the substitution character in their place.
class LostMappings {
 public:
  LostMappings(const Codepage& codepage, const LXObject* language, int32_t special) : codepage_(codepage) {
    if (special == 0 || codepage.utf8()) return;
    const Repertoire repertoire(codepage);
    for (uint32_t unicode = 0; unicode < 0x10000; ++unicode) {
      const auto unit = static_cast<LXUChar>(unicode);
      LXUChar result[2];
      const int32_t results = LXLangGetSpecial(language, unit, 0, &result[0], &result[1], special);
      for (int32_t i = 0; i < results; ++i) {
        if (repertoire.has(unit) && !repertoire.has(result[i])) lost_[unit] = result[i];
      }
    }
  }

  void count(const std::string& text, LXShiftState state) {
    if (lost_.empty()) return;
    std::vector<LXUChar> units(text.size());
    const auto length = static_cast<int32_t>(text.size());
    const int32_t count =
        LXStringToUnicodeEx(units.data(), length, codepage_.locale(), text.data(), state, length, 0);
    for (int32_t i = 0; i < count; ++i) {
      const auto found = lost_.find(units[static_cast<size_t>(i)]);
      if (found == lost_.end()) continue;
      if (count_++ == 0) first_ = found->first;
    }
  }

  void throw_any() const {
    if (count_ == 0) return;
    throw Failure(kDataError, std::to_string(count_) + (count_ == 1 ? " character" : " characters") +
                                  " lost: " + code_point_name(first_) + " maps to " +
                                  code_point_name(lost_.at(first_)) + ", which is not in " + codepage_.name());
  }

 private:
  const Codepage& codepage_;
  std::map<LXUChar, LXUChar> lost_;
  uint64_t count_ = 0;
  LXUChar first_ = 0;
};

/// Maps a text that comes in pieces. Each call of the library begins in the single-byte state, so a piece that
/// begins in the other one gets a shift byte in front, which is taken off again where the pieces meet.
class Mapper {
 public:
  Mapper(const Codepage& codepage, const LXObject* language, Mapping mapping, Output& output)
      : codepage_(codepage),
        finder_(codepage),
        language_(language),
        mapping_(mapping),
        output_(output),
        lost_(codepage, language, mapping.special) {}

  void take(const char* data, size_t bytes) {
    unseen_.append(data, bytes);
    look(false);
  }

  /// Ends the text.
  void finish() {
    look(true);
    map_whole();
    if (waiting_) settle();
  }

  void throw_losses() const { lost_.throw_any(); }

 private:
  /// Takes the well-formed text of unseen_, and malformed bytes as they are.
  void look(bool last) {
    size_t at = 0;
    while (at < unseen_.size()) {
      const char* const text = unseen_.data() + at;
      const Stretch stretch = finder_.next(text, unseen_.size() - at, unseen_state_, last);
      const size_t good = stretch.good_bytes;
      if (good == 0 && stretch.end == Stretch::End::kText) break;
      if (good > 0) take_good(text, good);
      if (stretch.end == Stretch::End::kMalformed) pass_on(text + good, stretch.end_bytes);
      at += good + stretch.end_bytes;
    }
    unseen_.erase(0, at);
  }

  void take_good(const char* text, size_t bytes) {
    if (codepage_.shift_sensitive()) codepage_.whole_bytes(text, bytes, unseen_state_, &unseen_state_);
    if (!text_.empty() && codepage_.is_shift(text_.back()) && codepage_.is_shift(*text)) map_whole();
    text_.append(text, bytes);
    map_safe();
  }

  void pass_on(const char* text, size_t bytes) {
    map_whole();
    if (written_state_ != state_) write_shift(state_);
    written_state_ = state_;
    waiting_ = false;
    output_.write(text, bytes);
  }

  /// A character near the end of text_: where it, or the shift byte before it, begins, and the state there.
  struct Char {
    size_t begin;
    LXShiftState state;
    LXUChar unicode;
  };

  /// The whole characters in the first bytes of text_.
  size_t whole_bytes(size_t bytes, LXShiftState* state) const {
    return codepage_.whole_bytes(text_.data(), bytes, state_, state);
  }

  /// The last whole characters of text_.
  std::vector<Char> tail() const {
    LXShiftState state;
    size_t at = whole_bytes(text_.size() - std::min(text_.size(), kTailBytes), &state);
    std::vector<Char> chars;
    while (at < text_.size()) {
      Char c{at, state, 0};
      if (codepage_.is_shift(text_[at])) state = codepage_.state_after(text_[at++]);
      if (at == text_.size()) break;
      const char* const text = text_.data() + at;
      const int32_t bytes = codepage_.char_bytes(text, state);
      if (static_cast<size_t>(bytes) > text_.size() - at) break;
      LXStringToUnicodeEx(&c.unicode, 1, codepage_.locale(), text, state, bytes, 0);
      chars.push_back(c);
      at += static_cast<size_t>(bytes);
    }
    return chars;
  }

  bool is_pair(const Char& first, const Char& second) const {
    LXUChar result[2];
    return LXLangGetSpecial(language_, first.unicode, second.unicode, &result[0], &result[1],
                            mapping_.special) != 0;
  }

  void map_whole() {
    LXShiftState state;
    const size_t whole = whole_bytes(text_.size(), &state);
    map(whole, state);
  }

  /// Maps as much of text_ as what follows cannot change.
  void map_safe() {
    if (mapping_.special == 0) return map_whole();
    const std::vector<Char> chars = tail();
    for (size_t i = chars.size(); i-- > 1;) {
      if (is_pair(chars[i - 1], chars[i])) continue;
      map(chars[i].begin, chars[i].state);
      return;
    }
  }

  /// Maps the first bytes of text_ and takes them off; `state` is the one behind them.
  void map(size_t bytes, LXShiftState state) {
    if (bytes == 0) return;
    std::string input = text_.substr(0, bytes);
    lost_.count(input, state_);
    if (state_ == LX_SHIFT_DOUBLE && !codepage_.is_shift(input[0]))
      input.insert(0, 1, codepage_.shift_byte(LX_SHIFT_DOUBLE));
    mapped_.resize(input.size() * kGrowth);
    const int32_t written =
        LXMapStringEx(codepage_.locale(), mapped_.data(), static_cast<int32_t>(mapped_.size()), input.data(),
                      static_cast<int32_t>(input.size()), mapping_.mode);
    if (written < 0)
      throw Failure(kDataError, "the mapping failed: " + describe_code(LXGetError(codepage_.locale())));
    // Shift bytes that meet in the text itself stay.
    if (waiting_ && written_state_ == LX_SHIFT_DOUBLE && after_shift_ && codepage_.is_shift(text_[0])) settle();
    write(mapped_.data(), static_cast<size_t>(written));
    after_shift_ = codepage_.is_shift(text_[bytes - 1]);
    text_.erase(0, bytes);
    state_ = state;
  }

  /// Writes a mapped piece, which begins in the single-byte state, behind what is written. A shift byte at its
  /// end waits for the next piece, which may begin with the other one.
  void write(const char* text, size_t bytes) {
    if (bytes == 0) return;
    LXShiftState end;
    LXMoveStringPointerEx(codepage_.locale(), text, LX_SHIFT_SINGLE, static_cast<int32_t>(bytes), &end, 0);
    if (codepage_.is_shift(*text)) {
      if (codepage_.state_after(*text) == written_state_) {
        ++text;
        --bytes;
      }
    } else if (written_state_ == LX_SHIFT_DOUBLE) {
      write_shift(LX_SHIFT_SINGLE);
    }
    waiting_ = bytes > 0 && codepage_.is_shift(text[bytes - 1]);
    if (waiting_) {
      --bytes;
      end = other_state(end);
    }
    output_.write(text, bytes);
    written_state_ = end;
  }

  static LXShiftState other_state(LXShiftState state) {
    return state == LX_SHIFT_DOUBLE ? LX_SHIFT_SINGLE : LX_SHIFT_DOUBLE;
  }

  /// Writes the shift byte that waits.
  void settle() {
    written_state_ = other_state(written_state_);
    write_shift(written_state_);
    waiting_ = false;
  }

  void write_shift(LXShiftState state) {
    const char shift = codepage_.shift_byte(state);
    output_.write(&shift, 1);
  }

  const Codepage& codepage_;
  const MalformedFinder finder_;
  const LXObject* language_;
  const Mapping mapping_;
  Output& output_;
  LostMappings lost_;
  std::string unseen_;                            // a cut character, then what is not looked at
  LXShiftState unseen_state_ = LX_SHIFT_SINGLE;   // at its beginning
  std::string text_;                              // well-formed and not yet mapped
  LXShiftState state_ = LX_SHIFT_SINGLE;          // at its beginning
  bool after_shift_ = false;                      // behind a shift byte of the text
  bool waiting_ = false;                          // a shift byte
  LXShiftState written_state_ = LX_SHIFT_SINGLE;  // at the end of the output
  std::vector<char> mapped_;
};

int map(const MapOptions& options, const CommonOptions& common) {
  const Session session(common);
  const LocalePtr named = open_chosen_locale(options.locale);
  const std::string language = text_item(named.get(), LX_ITEM_LANGUAGE).value_or("");
  const Codepage codepage(session, options.codepage, language_territory(named.get()));
  Input input(options.files);
  Pieces pieces(input);
  Output output(options.output);
  Mapper mapper(codepage, language_object(language), kMappings.at(options.mapping), output);
  pieces.each(!output.is_terminal(), [&](const char* data, size_t bytes) { mapper.take(data, bytes); });
  mapper.finish();
  output.commit();
  mapper.throw_losses();
  return kDone;
}

}  // namespace

Run declare_map(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<MapOptions>();
  command.add_option("MAPPING", options->mapping, "upper, lower, full, half (width) or digits")
      .required()
      .type_name("")
      .one_of(keys_of(kMappings));
  command
      .add_option("--locale", options->locale,
                  "locale whose language's own mappings are applied; else the user's locale")
      .type_name("LOCALE");
  command.add_option("--codepage", options->codepage, "codepage of the text; else UTF-8").type_name("CP");
  command.add_option("-o,--output", options->output, "output file, replaced when it is complete")
      .type_name("OUT");
  command.add_option("FILE", options->files, "input files, taken as one text; - is standard input")
      .not_empty()
      .type_name("");
  command.footer(
      "A character without a mapping stays as it is, and so do malformed bytes. Width is what the codepage has "
      "in both\n"
      "forms. A letter of the language that the codepage lacks is lost, which is said, and exits with 1.\n"
      "\n"
      "Examples:\n"
      "  lexicor map upper --locale German letter.txt\n"
      "  lexicor map half --codepage MS932 -o names.half names.txt");
  return [options, &common] { return map(*options, common); };
}

}  // namespace lexicor_cli
