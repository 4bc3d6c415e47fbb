// Every text that is written is read back at once, by the compiler's own reader: where the bytes differ (odd
// shift bytes, for one) the text is written as octal escapes from end to end.
#include "source_writer.h"

#include <array>
#include <cstdio>

#include "builder.h"
#include "lexicor/command.h"
#include "lexicor/hex.h"
#include "message_source.h"

namespace lexicor_gencat {

using lexicor_cli::Failure;
using lexicor_cli::kDataError;

namespace {

constexpr uint32_t kQuote = '"';

std::string octal(const std::string& bytes) {
  std::string text;
  for (const char byte : bytes) {
    char escape[8];
    std::snprintf(escape, sizeof escape, "\\%03o", static_cast<unsigned>(static_cast<unsigned char>(byte)));
    text += escape;
  }
  return text;
}

bool is_control(uint32_t unicode) {
  return unicode < 0x20 || (unicode >= 0x7F && unicode < 0xA0);
}

class SourceWriter {
 public:
  SourceWriter(const Encoding& own, const Encoding& source)
      : own_(own),
        source_(source),
        same_(own.codepage().name() == source.codepage().name()),
        reader_(source, own) {
    // Of the characters of a source, each must be there and be read as what it is.
    for (uint32_t c = 0; c < ascii_.size(); ++c) {
      ascii_[c] = source.ascii_based() ? c : source.find(c).value_or(0);
      if (is_syntax(c) && read_back(ascii_[c]).syntax != c)
        throw Failure(kDataError, "a source cannot be written in " + source.codepage().name() +
                                      ", which has no " + lexicor_cli::code_point_name(c));
    }
  }

  std::string write(const Catalog& catalog) {
    std::string out;
    line(out, "$ locale=" + catalog.locale);
    line(out, "$ codeset=" + source_.codepage().name());
    line(out, std::string("$ byte-order=") + (catalog.byte_order == ByteOrder::kBig ? "big" : "little"));
    line(out, "$quote \"");
    for (const auto& [number, messages] : catalog.sets) {
      line(out, "$set " + std::to_string(number));
      for (const auto& [message, text] : messages) write_message(out, message, text);
    }
    return out;
  }

 private:
  static bool is_syntax(uint32_t c) {
    return c == '\n' || c == ' ' || c == '$' || c == '@' || c == kQuote || c == '\\' || c == '=' || c == '-' ||
           c == '.' || c == '_' || (c >= '0' && c <= '9') || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z');
  }

  Character read_back(LXWChar code) const {
    TextWriter writer(source_.codepage());
    writer.put(code);
    const std::string bytes = writer.finish();
    CharacterReader reader(source_, bytes);
    return reader.at_end() ? Character() : reader.next();
  }

  void put_ascii(TextWriter& out, const std::string& text) const {
    for (const char c : text) out.put(ascii_[static_cast<unsigned char>(c) & 0x7F]);
  }

  void line(std::string& out, const std::string& text) const {
    TextWriter writer(source_.codepage());
    put_ascii(writer, text + "\n");
    out += writer.finish();
  }

  void write_message(std::string& out, uint32_t number, const std::string& text) {
    const std::string prefix = std::to_string(number) + " \"";
    std::string line = write_line(prefix, [&](TextWriter& writer) { put_text(writer, text); });
    if (text_of(line, prefix.size()) != text) {
      line = write_line(prefix, [&](TextWriter& writer) { put_ascii(writer, octal(text)); });
      if (text_of(line, prefix.size()) != text)
        throw Failure(kDataError, "message " + std::to_string(number) + " cannot be written as a source");
    }
    out += line;
  }

  template <class Put>
  std::string write_line(const std::string& prefix, Put put) const {
    TextWriter writer(source_.codepage());
    put_ascii(writer, prefix);
    put(writer);
    put_ascii(writer, "\"\n");
    return writer.finish();
  }

  void put_text(TextWriter& out, const std::string& text) const {
    bool behind_octal = false;
    for (CharacterReader reader(own_, text); !reader.at_end();) {
      const Character c = reader.next();
      const char letter = escape_letter(c.unicode);
      // Other compilers take any number of digits into an octal escape.
      const bool digit = behind_octal && c.unicode >= '0' && c.unicode <= '9';
      behind_octal = false;
      if (letter != 0 && own_.find(c.unicode) == c.code) {
        put_ascii(out, std::string("\\") + letter);
      } else if (c.unicode == Character::kNone || is_control(c.unicode) || digit || !put_character(out, c)) {
        put_ascii(out, octal(bytes_of(c.code, c.bytes)));
        behind_octal = true;
      }
    }
  }

  /// Writes a character as itself; false where it would not come back as it is.
  bool put_character(TextWriter& out, const Character& c) const {
    LXWChar code = c.code;
    uint32_t syntax = c.syntax;
    if (!same_) {
      const std::optional<LXWChar> found = source_.find(c.unicode);
      if (!found.has_value() || own_.find(c.unicode) != c.code) return false;
      const Character there = read_back(*found);
      if (there.unicode != c.unicode) return false;
      code = *found;
      syntax = there.syntax;
    }
    if (syntax == '\\' || syntax == kQuote) out.put(syntax == '\\' ? code : ascii_['\\']);
    out.put(code);
    return true;
  }

  std::string text_of(const std::string& line, size_t prefix_bytes) const {
    std::vector<Character> characters;
    LineReader(source_, line).next(characters);
    Problems problems;
    // The prefix is ASCII without its quote, so that it has as many characters.
    std::string text = read_message_text(characters, prefix_bytes - 1, kQuote, "", reader_, problems);
    return problems.errors() == 0 ? text : std::string();
  }

  const Encoding& own_;
  const Encoding& source_;
  bool same_;
  Recoder reader_;
  std::array<LXWChar, 0x80> ascii_;
};

}  // namespace

std::string write_source(const Catalog& catalog, const Encoding& own, const Encoding& source) {
  return SourceWriter(own, source).write(catalog);
}

}  // namespace lexicor_gencat
