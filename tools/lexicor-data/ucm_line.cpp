// Reading a line of a codepage table from left to right.
#include "ucm_line.h"

#include <cstring>

#include "lexicor/hex.h"
#include "line_text.h"

namespace lexicor_data {

using lexicor_cli::hex_text;

std::string byte_text(uint32_t byte) {
  return "\\x" + hex_text(byte, 2);
}

std::string code_text(uint32_t code, unsigned bytes) {
  std::string text;
  for (unsigned shift = bytes * 8; shift > 0; shift -= 8) text += byte_text(code >> (shift - 8) & 0xFF);
  return text;
}

std::string unicode_text(uint32_t unicode) {
  return "<U" + hex_text(unicode, 4) + ">";
}

UcmLine::UcmLine(const std::string& file, std::string line, int number)
    : file_(file), line_(std::move(line)), number_(number) {
  bool quoted = false;
  for (size_t i = 0; i < line_.size(); ++i) {
    if (line_[i] == '"') quoted = !quoted;
    if (line_[i] == '#' && !quoted) line_.resize(i);
  }
  while (!line_.empty() && is_blank(line_.back())) line_.pop_back();
}

void UcmLine::skip_blanks() {
  while (is_blank(peek())) ++at_;
}

bool UcmLine::take(char c) {
  if (peek() != c) return false;
  ++at_;
  return true;
}

bool UcmLine::take(const char* text) {
  if (line_.compare(at_, strlen(text), text) != 0) return false;
  at_ += strlen(text);
  return true;
}

void UcmLine::fail(Position where, const std::string& what) const {
  throw SourceError(file_, where.line, where.column, what);
}

void UcmLine::fail_expected(const std::string& expected) const {
  fail("found " + found() + ", expected " + expected);
}

void UcmLine::expect_end() {
  skip_blanks();
  if (!done()) fail_expected("the end of the line");
}

std::string UcmLine::word() {
  const size_t start = at_;
  while (!done() && !is_blank(peek())) ++at_;
  return line_.substr(start, at_ - start);
}

std::string UcmLine::up_to(char closing, const char* missing) {
  const size_t end = line_.find(closing, at_);
  if (end == std::string::npos) fail(missing);
  const std::string text = line_.substr(at_, end - at_);
  at_ = end + 1;
  return text;
}

std::string UcmLine::bracketed() {
  expect('<', "a key in angle brackets");
  return up_to('>', "the key has no closing bracket");
}

std::string UcmLine::quoted() {
  expect('"', "a text in quotes");
  return up_to('"', "the text has no closing quote");
}

uint32_t UcmLine::hex_number(int least, int most) {
  uint32_t value = 0;
  int digits = 0;
  for (; digits < most && hex_value(peek()) >= 0; ++digits) {
    value = value << 4 | static_cast<uint32_t>(hex_value(peek()));
    ++at_;
  }
  if (digits < least) fail_expected("a hexadecimal digit");
  return value;
}

uint8_t UcmLine::byte() {
  if (!take("\\x")) fail_expected("a byte as \\xHH");
  return static_cast<uint8_t>(hex_number(2, 2));
}

std::string UcmLine::found() const {
  if (done()) return "the end of the line";
  size_t end = at_;
  while (end < line_.size() && !is_blank(line_[end])) ++end;
  return "'" + line_.substr(at_, end - at_) + "'";
}

}  // namespace lexicor_data
