// Characters are read one by one through the public functions. What the library takes leniently (trail bytes of
// UTF-8, characters cut by a line end) is refused here, so that a byte that is no character spoils nothing
// behind it.
#include "encoding.h"

#include "lexicor/hex.h"

namespace lexicor_gencat {

using lexicor_cli::Codepage;
using lexicor_cli::kReplacement;

namespace {

constexpr uint32_t kLineFeed = 0x0A, kCarriageReturn = 0x0D, kNextLine = 0x85;
constexpr unsigned char kFirstDoubleByte = 0x40;  // below it no double-byte character begins

bool has_line_end(const char* text, int32_t bytes) {
  for (int32_t i = 1; i < bytes; ++i) {
    if (text[i] == '\n' || text[i] == '\r') return true;
  }
  return false;
}

}  // namespace

Encoding::Encoding(const Codepage& codepage)
    : codepage_(codepage),
      substitution_(codepage),
      single_(lexicor_cli::single_byte_values(codepage)),
      replacement_(find(kReplacement)),
      ascii_based_(single_['A'] == 'A' && single_['0'] == '0') {}

Character Encoding::read(const char* text, const char* end, LXShiftState state) const {
  Character character;
  character.code = static_cast<unsigned char>(*text);
  if (codepage_.utf8()) {
    character.unicode = lexicor_cli::long_utf8_code_point(text, end);
    if (character.unicode != 0) {
      character.bytes = lexicor_cli::kLongUtf8Bytes;
      for (size_t i = 1; i < lexicor_cli::kLongUtf8Bytes; ++i)
        character.code = character.code << 8 | static_cast<unsigned char>(text[i]);
      return character;
    }
  }
  const int32_t bytes = codepage_.char_bytes(text, state);
  character.unicode = Character::kNone;
  if (bytes > end - text || has_line_end(text, bytes)) return character;
  LXWChar code = character.code;
  for (int32_t i = 1; i < bytes; ++i) code = code << 8 | static_cast<unsigned char>(text[i]);
  const uint32_t unicode = unicode_of(text, bytes, code, state);
  if (unicode == Character::kNone && codepage_.utf8()) return character;
  character.unicode = unicode;
  character.code = code;
  character.bytes = static_cast<uint8_t>(bytes);
  character.syntax = syntax_of(character);
  return character;
}

uint32_t Encoding::unicode_of(const char* text, int32_t bytes, LXWChar code, LXShiftState state) const {
  LXUChar unit = kReplacement;
  if (bytes == 1)
    unit = single_[code];
  else if (LXStringToUnicodeEx(&unit, 1, codepage_.locale(), text, state, bytes, 0) != 1)
    return Character::kNone;
  if (unit == kReplacement && replacement_ != code) return Character::kNone;
  // UTF-8 is computed without a look at the trail bytes; what does not come back was none.
  if (codepage_.utf8() && LXCpUnicodeToCharW(codepage_.object(), unit) != code) return Character::kNone;
  return unit;
}

uint32_t Encoding::syntax_of(const Character& character) const {
  constexpr LXWChar kAsciiBackslash = 0x5C;
  if (ascii_based_ && character.bytes == 1 && character.code == kAsciiBackslash) return '\\';
  return character.unicode;
}

std::optional<LXWChar> Encoding::find(uint32_t unicode) const {
  if (unicode > 0xFFFF) return std::nullopt;
  const auto unit = static_cast<LXUChar>(unicode);
  const LXWChar code = LXCpUnicodeToCharW(codepage_.object(), unit);
  if (substitution_.stands_for(unit, code)) return std::nullopt;
  return code;
}

CharacterReader::CharacterReader(const Encoding& encoding, const std::string& text)
    : encoding_(encoding), at_(text.data()), end_(text.data() + text.size()) {}

bool CharacterReader::at_end() {
  const Codepage& codepage = encoding_.codepage();
  for (; at_ != end_ && codepage.is_shift(*at_); ++at_) state_ = codepage.state_after(*at_);
  // No double-byte character begins with a control: a line that was left open ends all the same.
  if (at_ != end_ && static_cast<unsigned char>(*at_) < kFirstDoubleByte) state_ = LX_SHIFT_SINGLE;
  return at_ == end_;
}

Character CharacterReader::next() {
  const Character character = encoding_.read(at_, end_, state_);
  at_ += character.bytes;
  return character;
}

bool has_byte_order_mark(const std::string& file) {
  return file.compare(0, kByteOrderMarkBytes, "\xEF\xBB\xBF") == 0;
}

LineReader::LineReader(const Encoding& encoding, const std::string& text)
    : encoding_(encoding), reader_(encoding, text) {
  if (!encoding.codepage().utf8() || !has_byte_order_mark(text)) return;
  reader_.next();
}

bool LineReader::is_line_end(const Character& character) const {
  if (character.unicode == kLineFeed) return true;
  return character.unicode == kNextLine && !encoding_.ascii_based();
}

bool LineReader::next(std::vector<Character>& line) {
  line.clear();
  if (reader_.at_end()) return false;
  ++line_;
  while (!reader_.at_end()) {
    Character character = reader_.next();
    if (is_line_end(character)) {
      if (!line.empty() && line.back().unicode == kCarriageReturn) line.pop_back();
      break;
    }
    character.line = line_;
    character.column = static_cast<int>(line.size()) + 1;
    line.push_back(character);
  }
  return true;
}

void TextWriter::set_state(LXShiftState state) {
  if (!codepage_.shift_sensitive() || state == state_) return;
  text_ += codepage_.shift_byte(state);
  state_ = state;
}

void TextWriter::put(LXWChar code) {
  set_state(code > 0xFF ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE);
  text_ += bytes_of(code, code > 0xFFFFFF ? 4 : code > 0xFFFF ? 3 : code > 0xFF ? 2 : 1);
}

void TextWriter::put_byte(char byte) {
  set_state(LX_SHIFT_SINGLE);
  text_ += byte;
}

std::string TextWriter::finish() {
  set_state(LX_SHIFT_SINGLE);
  return std::move(text_);
}

std::string bytes_of(LXWChar code, size_t bytes) {
  std::string text;
  for (size_t left = bytes; left > 0; --left) text += static_cast<char>(code >> 8 * (left - 1));
  return text;
}

std::string bytes_name(const Character& character) {
  return (character.bytes == 1 ? "byte " : "bytes ") +
         lexicor_cli::hex_bytes(bytes_of(character.code, character.bytes));
}

}  // namespace lexicor_gencat
