// lexicor explain: the collation elements of two texts, their weights level by level as they are compared, and
// the weight that decides.
#include <lx.h>

#include <algorithm>
#include <memory>
#include <sstream>
#include <utility>
#include <vector>

#include "arguments.h"
#include "collation.h"
#include "command.h"
#include "hex.h"
#include "output.h"
#include "report.h"

namespace lexicor_cli {

namespace {

struct ExplainOptions {
  std::string locale;  // empty: the user's
  std::string rules;   // a file; empty: the locale's sort
  std::string text1, text2;
  bool json = false;
};

/// One level of a text: its weights in the order in which they are compared.
struct Level {
  std::vector<uint32_t> weights;
  size_t insert_point = 0;

  void place(uint32_t weight, bool append) {
    weights.insert(append ? weights.end() : weights.begin() + static_cast<ptrdiff_t>(insert_point), weight);
    if (append) insert_point = weights.size();
  }
};

/// What is known of a level before any text: its name, how its weights look, and the class bit for appending.
struct LevelKind {
  const char* title;
  int digits;
  uint8_t append;
};
constexpr LevelKind kLevels[] = {{"primary", 4, LX_APPEND_PRIMARY},
                                 {"secondary", 2, LX_APPEND_SECONDARY},
                                 {"tertiary", 2, LX_APPEND_TERTIARY},
                                 {"special", 4, LX_APPEND_SPECIAL}};
constexpr size_t kLevelCount = 4;
constexpr size_t kSecondary = 1, kTertiary = 2, kSpecial = 3;
constexpr char kPlacement[] = "weights are";
constexpr LevelKind kBytes = {"bytes", 2, 0};

using Row = std::vector<std::string>;

/// A text, taken apart: rows of its elements for the reader, and its levels.
struct Explained {
  std::vector<Row> rows;
  std::vector<Level> levels;
};

/// A character of a text.
struct Char {
  std::string bytes;
  LXUChar unicode;
  std::string shown;
};

/// A control character is not shown, nor is what has no value in 16-bit Unicode: its bytes are.
std::string shown(const Codepage& codepage, const Char& c) {
  char bytes[8];
  const int32_t count = LXCpUnicodeToChar(codepage.object(), c.unicode, bytes);
  if (c.bytes != std::string_view(bytes, static_cast<size_t>(count)))
    return (c.bytes.size() == 1 ? "byte " : "bytes ") + hex_bytes(c.bytes);
  return c.unicode < 0x20 || (c.unicode >= 0x7F && c.unicode < 0xA0) ? "" : c.bytes;
}

std::vector<Char> chars_of(const Codepage& codepage, const std::string& text) {
  std::vector<Char> chars;
  for (size_t at = 0; at < text.size();) {
    const int32_t bytes = codepage.char_bytes(&text[at], LX_SHIFT_SINGLE);
    Char c{text.substr(at, static_cast<size_t>(bytes)), 0, ""};
    LXStringToUnicode(&c.unicode, 1, codepage.locale(), &text[at], bytes, 0);
    c.shown = shown(codepage, c);
    chars.push_back(c);
    at += c.bytes.size();
  }
  return chars;
}

std::string weight_text(const LevelKind& kind, uint32_t weight) {
  if (kind.append != LX_APPEND_SPECIAL) return hex_text(weight, kind.digits);
  const std::string position = weight >> 16 == 0 ? "" : hex_text(weight >> 16, kind.digits) + ":";
  return position + hex_text(weight & 0xFFFF, kind.digits);
}

/// The rows and levels of a text under the locale's sort.
class Weigher {
 public:
  Weigher(LXLocale* locale, const std::vector<Char>& chars) : locale_(locale), chars_(chars) {
    text_.levels.resize(kLevelCount);
    text_.rows.push_back({"", "primary", "secondary", "tertiary", "special", kPlacement, "character"});
    std::vector<LXUChar> units;
    for (const Char& c : chars) units.push_back(c.unicode);
    const LXUChar* next = units.data();
    for (auto remaining = static_cast<int32_t>(units.size()); remaining > 0;) take_element(&next, &remaining);
  }

  Explained text() { return std::move(text_); }

 private:
  void take_element(const LXUChar** next, int32_t* remaining) {
    LXWeights first{}, second{};
    uint8_t char_class = 0;
    const size_t start = at_;
    const int32_t sets =
        LXStrGetNextWeightU(locale_, next, remaining, &counter_, &first, &second, &char_class, &look_ahead_);
    at_ = chars_.size() - static_cast<size_t>(*remaining);
    std::string name, characters;
    for (size_t i = start; i < at_; ++i) {
      name += (i > start ? " " : "") + code_point_name(chars_[i].unicode);
      characters += chars_[i].shown;
    }
    add(name, characters, first, char_class);
    if (sets == 2) add("", "", second, char_class);
  }

  void add(const std::string& name, const std::string& characters, const LXWeights& weights,
           uint8_t char_class) {
    const uint32_t values[kLevelCount] = {weights.primary, weights.secondary, weights.tertiary,
                                          weights.special};
    Row row = {"  " + (name.empty() ? "  and" : name)};
    std::string inserted;
    bool weighs = false;
    for (size_t i = 0; i < kLevelCount; ++i) {
      const LevelKind& kind = kLevels[i];
      row.push_back(values[i] == 0 ? "-" : hex_text(values[i], kind.digits));
      if (values[i] == 0) continue;
      weighs = true;
      const bool append = (char_class & kind.append) != 0;
      if (!append) inserted += (inserted.empty() ? "inserted: " : ", ") + std::string(kind.title);
      const uint32_t position = i == kSpecial ? uint32_t{counter_} << 16 : 0;
      text_.levels[i].place(position | values[i], append);
    }
    row.push_back(!weighs ? "none: ignored" : inserted.empty() ? "appended" : inserted);
    row.push_back(characters);
    text_.rows.push_back(row);
  }

  LXLocale* locale_;
  const std::vector<Char>& chars_;
  size_t at_ = 0;         // behind the characters of the last element
  uint16_t counter_ = 0;  // the position of its special weight
  LXUChar look_ahead_ = LX_NO_LOOK_AHEAD;
  Explained text_;
};

/// Takes off the levels what the text's key leaves out: the usual weights at the end of the second and third
/// level, and positions where there are no other weights.
void leave_out(const std::string& key, std::vector<Level>& levels) {
  size_t begin = 2 * levels[0].weights.size() + 1;
  size_t others = levels[0].weights.size();
  for (const size_t level : {kSecondary, kTertiary}) {
    const size_t end = key.find('\0', begin);
    levels[level].weights.resize(end - begin);
    others += end - begin;
    begin = end + 1;
  }
  if (others > 0) return;
  for (uint32_t& weight : levels[kSpecial].weights) weight &= 0xFFFF;
}

/// In binary order the bytes are all that counts.
Explained bytes_of(const std::vector<Char>& chars) {
  Explained text;
  text.levels.resize(1);
  text.rows.push_back({"", "bytes", "character"});
  for (const Char& c : chars) {
    for (const char byte : c.bytes) text.levels[0].place(static_cast<uint8_t>(byte), true);
    text.rows.push_back({"  " + code_point_name(c.unicode), hex_bytes(c.bytes), c.shown});
  }
  return text;
}

void write_table(std::ostream& out, const std::vector<Row>& rows) {
  std::vector<size_t> chars(rows[0].size());
  for (const Row& row : rows) {
    // The last column, of characters that may be of any width, is not filled up.
    for (size_t i = 0; i + 1 < row.size(); ++i) chars[i] = std::max(chars[i], row[i].size());
  }
  for (const Row& row : rows) {
    std::string line;
    for (size_t i = 0; i < row.size(); ++i) line += (i > 0 ? "  " : "") + padded(row[i], chars[i]);
    out << line.substr(0, line.find_last_not_of(' ') + 1) << '\n';
  }
}

/// What a level says: the place of the weight that decides, if one does, and a remark for the reader.
struct Verdict {
  bool decides;
  std::string text;
};

Verdict judge(const LevelKind& kind, const Level& a, const Level& b) {
  const size_t shorter = std::min(a.weights.size(), b.weights.size());
  const auto place = static_cast<size_t>(
      std::mismatch(a.weights.begin(), a.weights.begin() + static_cast<ptrdiff_t>(shorter), b.weights.begin())
          .first -
      a.weights.begin());
  if (place == a.weights.size() && place == b.weights.size())
    return {false, place == 0 ? "no weights" : "equal"};
  const auto weight = [&](const Level& level) {
    return place < level.weights.size() ? weight_text(kind, level.weights[place]) : "none";
  };
  return {true, "decides: number " + std::to_string(place + 1) + " is " + weight(a) + " in A, " + weight(b) +
                    " in B"};
}

void write_level(std::ostream& out, const LevelKind& kind, const Level& level, char name) {
  out << "  " << name;
  for (size_t i = 0; i < level.weights.size(); ++i) out << ' ' << weight_text(kind, level.weights[i]);
  out << '\n';
}

/// The levels of both texts; returns the title of the one that decides, or an empty text.
std::string write_levels(std::ostream& out, const Explained& a, const Explained& b) {
  std::string decided;
  for (size_t i = 0; i < a.levels.size(); ++i) {
    const LevelKind& kind = a.levels.size() == 1 ? kBytes : kLevels[i];
    const Verdict verdict = judge(kind, a.levels[i], b.levels[i]);
    out << '\n' << kind.title << ": " << (decided.empty() ? verdict.text : "not reached") << '\n';
    write_level(out, kind, a.levels[i], 'A');
    write_level(out, kind, b.levels[i], 'B');
    if (decided.empty() && verdict.decides) decided = kind.title;
  }
  return decided;
}

/// A text's elements, by the titles of their columns.
Json json_elements(const std::vector<Row>& rows) {
  Json elements = Json::array();
  for (size_t r = 1; r < rows.size(); ++r) {
    const Row& row = rows[r];
    Json element = {{"element", row[0].substr(row[0].find_first_not_of(' '))}};
    for (size_t i = 1; i < row.size(); ++i) element[rows[0][i] == kPlacement ? "placed" : rows[0][i]] = row[i];
    elements.push_back(element);
  }
  return elements;
}

Json json_levels(const Explained& a, const Explained& b) {
  Json levels = Json::array();
  for (size_t i = 0; i < a.levels.size(); ++i) {
    const LevelKind& kind = a.levels.size() == 1 ? kBytes : kLevels[i];
    Json level = {{"level", kind.title}, {"a", Json::array()}, {"b", Json::array()}};
    for (const uint32_t weight : a.levels[i].weights) level["a"].push_back(weight_text(kind, weight));
    for (const uint32_t weight : b.levels[i].weights) level["b"].push_back(weight_text(kind, weight));
    levels.push_back(level);
  }
  return levels;
}

int explain(const ExplainOptions& options, const CommonOptions& common) {
  RulesSession session(common, options.rules);
  Collation collation(session, options.locale);
  collation.check_argument(options.text1);
  collation.check_argument(options.text2);
  std::ostringstream out;
  const auto take_apart = [&](char name, const std::string& text) {
    const std::vector<Char> chars = chars_of(collation.codepage(), text);
    Explained explained =
        collation.binary() ? bytes_of(chars) : Weigher(collation.codepage().locale(), chars).text();
    if (!collation.binary()) {
      std::string key;
      collation.append_key(text, 0, &key);
      leave_out(key, explained.levels);
    }
    explained.rows[0][0] = name;
    write_table(out, explained.rows);
    return explained;
  };
  const std::string sort = text_item(collation.codepage().locale(), LX_ITEM_SORT).value_or("");
  out << "sort " << sort << "\n\n";
  const Explained a = take_apart('A', options.text1);
  out << '\n';
  const Explained b = take_apart('B', options.text2);
  const std::string decided = write_levels(out, a, b);
  const int32_t order = collation.compare(options.text1, options.text2, 0);
  if (options.json) {
    Output().write(json_text({{"sort", sort},
                              {"a", {{"text", options.text1}, {"elements", json_elements(a.rows)}}},
                              {"b", {{"text", options.text2}, {"elements", json_elements(b.rows)}}},
                              {"levels", json_levels(a, b)},
                              {"order", order == 0  ? "="
                                        : order < 0 ? "<"
                                                    : ">"},
                              {"decided_by", decided}}));
    return kDone;
  }
  out << '\n'
      << options.text1 << sign_text(order) << options.text2 << ": "
      << (decided.empty() ? "nothing decides"
                          : "decided by the " + decided + (collation.binary() ? "" : " weights"))
      << '\n';
  Output().write(out.str());
  return kDone;
}

}  // namespace

Run declare_explain(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<ExplainOptions>();
  command.add_option("--locale", options->locale, "locale whose sort is used; else the user's locale")
      .type_name("LOCALE");
  add_rules_option(command, options->rules);
  command.add_option("A", options->text1, "a text, in UTF-8").required().type_name("");
  command.add_option("B", options->text2, "another one").required().type_name("");
  command.add_flag("--json", options->json, "print JSON");
  command.footer(
      "Shows the elements of each text with their weights in hexadecimal: a character, a pair that sorts as "
      "one,\n"
      "or the two of an expansion. Appended weights stand behind those before them; inserted ones ahead of the "
      "run\n"
      "of such. Then come the weights as the text's key has them, in the order in which they are compared: "
      "usual\n"
      "ones at the end of the second and third level are left out, and a special one stands behind the "
      "position "
      "of its\n"
      "character where there are others. In binary order the bytes of the text take the place of weights.\n"
      "\n"
      "Examples:\n"
      "  lexicor explain --locale French@FrenchCanadian côte coté\n"
      "  lexicor explain --locale Czech@Czech chata cihla");
  return [options, &common] { return explain(*options, common); };
}

}  // namespace lexicor_cli
