// Text cases in files. A line is a case: marks in brackets, the family, words and texts, "=", and what comes
// out. A line that begins with blanks goes on with the one before it. Lines that begin with "with" set values
// of the locale for the cases behind them, up to an empty line. "#" begins a comment.
//
//   [U W @SJIS] family word name=value "text" name="text" = result
//
// A mark is a form, or behind "@" a codepage, to which the case is restricted; "unshifted" is the plain form in
// shift-sensitive codepages. A text is UTF-8 with the escapes \n, \", \\, \uNNNN for a Unicode value, \xNN for
// a byte of the codepage, \> for Shift-Out, \< for Shift-In, and \- for nothing. A text with one of the last
// four is taken as its bytes are, in the plain and the Ex form alone.
//
// Every case runs with the lengths of its texts and with nulls behind them, unless it gives "length", or says
// "by-length" or "by-null". Texts that are written are written with LX_TERMINATE too, unless it says "once".
// "state", "state2" and "output-state" are the shift states that a call begins in. Behind "=" all families know
// "error" for the stored code, "state" for the shift state that comes back, and "says" for the trace.
#pragma once

#include <stdexcept>
#include <string>
#include <vector>

#include "support/encoded_text.h"

namespace lx::test {

/// What is wrong with a case, with file and line.
struct CaseError : std::runtime_error {
  using std::runtime_error::runtime_error;
};

struct CaseText {
  enum : uint32_t { kByte = 0x10000, kShiftOut = 0x20000, kShiftIn = 0x30000, kNothing = 0x40000 };
  std::vector<uint32_t> values;  // Unicode values; bytes with kByte; the others

  bool raw() const;
  Units units() const { return Units(values.begin(), values.end()); }
  /// The bytes of a raw text, or of any text without shift bytes.
  std::string bytes(const TinyCodepage& cp) const;
  bool in(const TinyCodepage& cp) const;
};

/// Words and texts in order, each with a name or without one; whoever asks for one has used it.
class CaseWords {
 public:
  struct Word {
    std::string name, value;
    CaseText text;
    bool quoted = false;
    mutable bool used = false;
  };
  std::vector<Word> all;

  bool has(const std::string& word) const { return find(word, false) != nullptr; }
  bool has_text(const std::string& name = "") const;
  /// The next text of this name that is not used; throws when there is none.
  const CaseText& text(const std::string& name = "") const;
  /// The next word that is not used; throws when there is none.
  std::string word() const;
  /// The number of this name.
  int32_t number(const std::string& name, int32_t otherwise) const;
  /// The words that nobody used.
  std::string unused() const;
  void reset() const;

 private:
  const Word* find(const std::string& name, bool quoted) const;
};

struct Case {
  std::string place;  // file and line
  std::vector<std::string> marks;
  std::string family;
  CaseWords given, expected;
  std::vector<CaseWords> with;
};
std::vector<Case> read_cases(const std::string& path);

}  // namespace lx::test
