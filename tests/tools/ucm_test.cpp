// Codepage tables in the .ucm form: what the reader refuses and where it says so, and the form that is written.
#include "ucm.h"

#include <gtest/gtest.h>

#include <sstream>

namespace lexicor_data {
namespace {

constexpr char kSingleHeader[] =  // 6 lines
    "<code_set_name> \"Test\"\n<uconv_class> \"SBCS\"\n<mb_cur_max> 1\n<subchar> \\x3F\n"
    "<lexicor:line_ends> \\x0A\\x0D\\x0A\\x0A\n<lexicor:ascii> yes\n";

std::string replaced(std::string text, const std::string& from, const std::string& to) {
  const size_t at = text.find(from);
  EXPECT_NE(at, std::string::npos) << from;
  return text.replace(at, from.size(), to);
}

std::string with_leads(const std::string& leads) {
  const std::string text = replaced(kSingleHeader, "SBCS", "MBCS");
  return replaced(text, "max> 1", "max> 3") + "<lexicor:leads> " + leads + "\n";
}

std::string multi_table(const std::string& mappings) {
  return with_leads("81-8E:2 8F:3 90-9F:2") + "CHARMAP\n" + mappings + "END CHARMAP\n";
}

std::string shift_table(const std::string& mappings) {
  const std::string text = replaced(kSingleHeader, "SBCS", "EBCDIC_STATEFUL");
  return replaced(text, "max> 1", "max> 2") + "CHARMAP\n" + mappings + "END CHARMAP\n";
}

std::string single_table(const std::string& mappings) {
  return kSingleHeader + ("CHARMAP\n" + mappings) + "END CHARMAP\n";
}

CodepageSource read_text(const std::string& text) {
  std::istringstream in(text);
  return read_ucm(in, "test.ucm");
}

TEST(Ucm, RefusesAndSaysWhere) {
  const std::string head = kSingleHeader;
  const struct {
    std::string text;
    int line, column;
    const char* what;  // a part of the message
  } cases[] = {
      // Keys.
      {"", 1, 1, "<code_set_name> is missing"},
      {head, 7, 1, "CHARMAP is missing"},
      {head + "<icu:base> \"x\"\n", 7, 1, "unknown key <icu:base>"},
      {head + "<subchar> \\x1A\n", 7, 1, "line 4 already"},
      {head + "<subchar \\x1A\n", 7, 2, "closing bracket"},
      {replaced(head, "\"Test\"", "\"Test"), 1, 18, "closing quote"},
      {replaced(head, "\"Test\"", "\"\""), 1, 17, "empty"},
      {replaced(head, "\"Test\"", "Test"), 1, 17, "found 'Test', expected a text in quotes"},
      {replaced(head, "\"Test\"", "\"Test\" 1"), 1, 24, "found '1', expected the end of the line"},
      {replaced(head, "SBCS", "DBCS"), 2, 15, "found class \"DBCS\", expected \"SBCS\""},
      {replaced(head, "max> 1", "max> 5"), 3, 14, "found '5', expected a width"},
      {replaced(head, "\\x3F", "\\x3"), 4, 14, "found the end of the line, expected a hexadecimal digit"},
      {replaced(head, "\\x0D\\x0A\\x0A", "\\x0D\\x0A"), 5, 33, "expected a byte"},
      {replaced(head, "yes", "maybe"), 6, 17, "found 'maybe', expected yes or no"},
      {head + "<lexicor:algorithm> \"UTF-7\"\n", 7, 21, "expected \"UTF-8\""},
      // Keys that contradict each other.
      {replaced(head, "max> 1", "max> 2") + "CHARMAP\nEND CHARMAP\n", 3, 1, "does not agree with the class"},
      {head + "<lexicor:leads> 81:2\nCHARMAP\n", 7, 1, "only the class MBCS has leads"},
      {head + "<lexicor:algorithm> \"UTF-8\"\n", 7, 1, "needs the class MBCS"},
      {with_leads("81-9F:2 8F:3"), 7, 25, "lead 8F is named twice"},
      {with_leads("81:2") + "CHARMAP\n", 3, 1, "not that of the longest lead, 2"},
      {with_leads("9F-81:2"), 7, 17, "runs backwards"},
      {with_leads("81-9F:1"), 7, 23, "found '1', expected a length"},
      {with_leads("81-9F2"), 7, 22, "expected a colon"},
      {with_leads("00:2"), 7, 17, "byte 00"},
      {replaced(with_leads("X"), "<lexicor:leads> X\n", "") + "CHARMAP\n", 7, 1, "is missing"},
      {replaced(multi_table(""), "CHARMAP", "<lexicor:algorithm> \"UTF-8\"\nCHARMAP"), 9, 1,
       "computed codepage"},
      // Mappings: line 8 is the first.
      {single_table("\\x41 |0\n"), 8, 1, "found '\\x41', expected a mapping"},
      {single_table("<X0041> \\x41 |0\n"), 8, 2, "expected a code point"},
      {single_table("<U0041>\\x41 |0\n"), 8, 8, "expected a blank"},
      {single_table("<U110000> \\x41 |0\n"), 8, 1, "above <U10FFFF>"},
      {single_table("<U00E6>+<U0300> \\x41 |0\n"), 8, 8, "one code point a mapping"},
      {single_table("<U0041> \\x41\\x42\\x43\\x44\\x45 |0\n"), 8, 25, "at most 4 bytes"},
      {single_table("<U0041> \\x41\n"), 8, 13, "expected the precision"},
      {single_table("<U0041> \\x41 |2\n"), 8, 15, "found '2', expected precision 0, 1 or 3"},
      {kSingleHeader + std::string("CHARMAP\n<U0041> \\x41 |0\n"), 9, 1, "END CHARMAP is missing"},
      {single_table("") + "<U0041> \\x41 |0\n", 9, 1, "nothing after END CHARMAP"},
      // Lengths against class and leads, in every direction of mapping.
      {single_table("<U0041> \\x41\\x42 |0\n"), 8, 9, "2 bytes, but \\x41 begins characters of 1"},
      {multi_table("<U0041> \\xA0\\x42 |3\n"), 9, 9, "\\xA0 begins characters of 1"},
      {multi_table("<U0041> \\x81 |1\n"), 9, 9, "1 byte, but \\x81 begins characters of 2"},
      {shift_table("<U0041> \\x41\\x42\\x43 |0\n"), 8, 9, "3 bytes, expected 1 or 2"},
      {shift_table("<U000E> \\x0E |0\n"), 8, 9, "shift byte"},
      {shift_table("<U0041> \\x00\\x42 |0\n"), 8, 9, "begins with a zero byte"},
      // Duplicates: the later line, wherever the lines stand.
      {single_table("<U0041> \\x41 |0\n<U0043> \\x43 |0\n<U0042> \\x41 |3\n"), 10, 9,
       "\\x41 is mapped on line 8"},
      {single_table("<U0041> \\x41 |3\n<U0042> \\x41 |3\n"), 9, 9, "\\x41 is mapped on line 8"},
      {single_table("<U0041> \\x41 |0\n\n<U0041> \\x42 |1\n"), 10, 1, "<U0041> is mapped on line 8"},
      {single_table("<U0041> \\x41 |1\n<U0041> \\x42 |1\n"), 9, 1, "<U0041> is mapped on line 8"},
  };
  for (const auto& [text, line, column, what] : cases) {
    SCOPED_TRACE(text);
    try {
      read_text(text);
      ADD_FAILURE() << "accepted";
    } catch (const SourceError& error) {
      const std::string message = error.what();
      const std::string place = "test.ucm:" + std::to_string(line) + ":" + std::to_string(column) + ": ";
      EXPECT_EQ(message.find(place), 0U) << message;
      EXPECT_NE(message.find(what), std::string::npos) << message;
    }
  }
}

TEST(Ucm, ReadsFreelyAndWritesCanonically) {
  const std::string text =
      "# a comment\r\n<lexicor:ascii>\tyes # a comment\n<lexicor:source> \"table #1\"\n"
      "  <uconv_class>\"MBCS\"\n<mb_cur_max> 3\n<subchar> \\x1a\n<lexicor:leads> 8f:3   81-8E:2 90:2\n"
      "<lexicor:line_ends> \\x0A\\x0D\\x0A\\x85 \n<code_set_name> \"Test\"\n\nCHARMAP\n"
      "  <U20BB7> \\x8f\\xa1\\xa1 |0\n<U00A5> \\x41 |1\n<U0041>\t\\x42  |3 # twice\r\n"
      "<U0041> \\x41 |0\nEND CHARMAP # end\n# after\n";
  std::ostringstream out;
  write_ucm(out, read_text(text));
  EXPECT_EQ(out.str(),
            "<code_set_name>       \"Test\"\n"
            "<lexicor:source>      \"table #1\"\n"
            "<uconv_class>         \"MBCS\"\n"
            "<mb_cur_max>          3\n<subchar>             \\x1A\n"
            "<lexicor:line_ends>   \\x0A\\x0D\\x0A\\x85\n"
            "<lexicor:ascii>       yes\n"
            "<lexicor:leads>       81-8E:2 8F:3 90:2\n"
            "CHARMAP\n<U0041> \\x41 |0\n<U0041> \\x42 |3\n<U00A5> \\x41 |1\n"
            "<U20BB7> \\x8F\\xA1\\xA1 |0\nEND CHARMAP\n");
}

TEST(Ucm, WriterRefusesTextThatCannotBeReadBack) {
  CodepageSource source = read_text(single_table(""));
  for (const char* text : {"a \"quoted\" word", "two\nlines"}) {
    source.source = text;
    std::ostringstream out;
    EXPECT_THROW(write_ucm(out, source), SourceError) << text;
  }
}

}  // namespace
}  // namespace lexicor_data
