// Streams step by step: the scripts in tests/cases/stream say what the far end does and what each call answers.
//   open CODEPAGE read "BYTES", open CODEPAGE write    a stream
//   far STEP...     what the next calls of the far end do: move so many bytes, fail below 0, claim more than
//   was asked for
//                   (nonsense); STEP*N for N of them. All that is asked for is moved after that
//   N CALL ...      a call N times
//   CALL ARGUMENTS -> RESULT CODE    the code may be left out if it is 0; END, FAILURE and NO_UNIT are results
//   lines SIZE FLAGS -> "LINE|LINE|CODE"    strings to the end, nulls as dots, "=COUNT" behind lines of
//   characters
#include <gtest/gtest.h>

#include <cstring>
#include <fstream>
#include <memory>
#include <sstream>

#include "stream/stream_texts.h"

namespace {

using namespace lx::test;

/// The words of a line; those in quotes without them, \xHH, \r, \n and \0 as bytes.
std::vector<std::string> words_of(const std::string& line) {
  std::vector<std::string> words;
  for (size_t at = line.find_first_not_of(' '); at < line.size(); at = line.find_first_not_of(' ', at)) {
    const bool quoted = line[at] == '"';
    std::string word;
    for (at += quoted; at < line.size() && line[at] != (quoted ? '"' : ' '); ++at) {
      if (line[at] != '\\') {
        word += line[at];
      } else if (line[++at] == 'x') {
        word += static_cast<char>(std::stoi(line.substr(at + 1, 2), nullptr, 16));
        at += 2;
      } else {
        word += line[at] == 'n' ? '\n' : line[at] == 'r' ? '\r' : '\0';
      }
    }
    at += quoted;
    words.push_back(word);
  }
  return words;
}

int64_t number(const std::string& word) {
  const std::map<std::string, int64_t> names = {
      {"END", LX_STREAM_END},    {"FAILURE", LX_STREAM_FAILURE}, {"NO_UNIT", LX_STREAM_NO_UNIT},
      {"nonsense", kNonsense},   {"crlf", LX_EOL_CRLF},          {"lf", LX_EOL_LF},
      {"drop", LX_DROP_RETURNS}, {"chars", LX_CHARACTERS},       {"terminate", LX_TERMINATE},
      {"read", LX_STREAM_READ},  {"write", LX_STREAM_WRITE}};
  const size_t plus = word.find('+');
  if (plus != std::string::npos) return number(word.substr(0, plus)) | number(word.substr(plus + 1));
  const auto name = names.find(word);
  return name != names.end() ? name->second : std::stoll(word, nullptr, 0);
}

class StreamScript : public testing::Test {
 protected:
  void TearDown() override { EXPECT_TRUE(library_.close()); }

  void open(const std::vector<std::string>& words) {
    if (words[2] == "read") peer_ = std::make_unique<Sender>();
    if (words[2] == "write") peer_ = std::make_unique<Receiver>();
    if (words[2] == "read") peer_->bytes = words[3];
    for (const TinyCodepage& cp : codepages_)
      if (cp.file.name == "TINY-" + words[1]) locale_ = library_.locale(cp);
    stream_ = LXOpenStream(locale_, Peer::transfer, peer_.get(), static_cast<uint32_t>(number(words[2])));
    ASSERT_NE(stream_, nullptr);
  }

  void far(const std::vector<std::string>& words) {
    peer_->script.resize(peer_->calls);
    for (size_t i = 1; i < words.size(); ++i) {
      const size_t star = words[i].find('*');
      const size_t times =
          star == std::string::npos ? 1 : static_cast<size_t>(number(words[i].substr(star + 1)));
      peer_->script.insert(peer_->script.end(), times, static_cast<int32_t>(number(words[i].substr(0, star))));
    }
  }

  /// Strings to the end, at most 20.
  std::string lines(decltype(LXReadString)* read, int32_t size, uint32_t flags) {
    const bool characters = (flags & LX_CHARACTERS) != 0;
    std::string all;
    for (int calls = 0; calls < 20; ++calls) {
      std::string block(static_cast<size_t>(size) * (characters ? 4 : 1), '#');
      block.shrink_to_fit();
      const int32_t n = read(stream_, locale_, block.data(), size, flags);
      if (n < 0) return all + std::to_string(n);
      all += block.substr(0, characters ? block.find('#') : static_cast<size_t>(n));
      all += characters ? '=' + std::to_string(n) + '|' : "|";
    }
    return all;
  }

  /// What a call answers: a text, or a number in the other one.
  std::string text(const std::vector<std::string>& words, int64_t* value) {
    const std::string& call = words[0];
    const auto argument = [&](size_t i) { return number(words[i]); };
    const auto size = [&] { return static_cast<int32_t>(argument(1)); };
    const auto flags = [&] { return static_cast<uint32_t>(argument(2)); };
    const auto code = [&] { return static_cast<LXWChar>(argument(1)); };
    const auto state = [&] { return static_cast<LXShiftState>(argument(2)); };
    const std::vector<char> exact(words.size() > 1 ? words[1].begin() : call.end(),
                                  words.size() > 1 ? words[1].end() : call.end());
    if (call == "lines" || call == "linesEx") {
      std::string all = lines(call == "lines" ? LXReadString : LXReadStringEx, size(), flags());
      std::replace(all.begin(), all.end(), '\0', '.');
      return all;
    }
    if (call == "sent") return std::exchange(peer_->bytes, {});
    const std::map<std::string, std::function<int64_t()>> calls = {
        {"readW", [&] { return int64_t{LXReadCharW(stream_, locale_)}; }},
        {"readU", [&] { return int64_t{LXReadCharU(stream_, locale_)}; }},
        {"unget", [&] { return LXUngetChar(stream_, locale_, exact.data()); }},
        {"ungetEx", [&] { return LXUngetCharEx(stream_, locale_, exact.data(), state()); }},
        {"ungetW", [&] { return LXUngetCharW(stream_, locale_, code()); }},
        {"ungetU", [&] { return LXUngetCharU(stream_, locale_, static_cast<LXUChar>(code())); }},
        {"write", [&] { return LXWriteChar(stream_, locale_, exact.data()); }},
        {"writeEx", [&] { return LXWriteCharEx(stream_, locale_, exact.data(), state(), 0); }},
        {"writeW", [&] { return LXWriteCharW(stream_, locale_, code(), 0); }},
        {"flush", [&] { return LXFlushStream(stream_, locale_); }},
        {"close", [&] { return LXCloseStream(stream_, locale_); }},
        {"calls", [&] { return static_cast<int64_t>(peer_->calls); }}};
    *value = calls.at(call)();
    return {};
  }

  void run(std::vector<std::string> words) {
    if (words[0] == "open") return open(words);
    if (words[0] == "far") return far(words);
    int64_t times = 1;
    if (isdigit(words[0][0]) != 0) times = number(words[0]), words.erase(words.begin());
    const auto arrow = std::find(words.begin(), words.end(), "->");
    ASSERT_NE(arrow, words.end());
    const std::vector<std::string> call(words.begin(), arrow), expected(arrow + 1, words.end());
    for (; times > 0; --times) {
      int64_t value = INT64_MIN;
      const std::string got = text(call, &value);
      if (value == INT64_MIN) {
        EXPECT_EQ(testing::PrintToString(got), testing::PrintToString(expected[0]));
        continue;
      }
      EXPECT_EQ(value, number(expected[0]));
      EXPECT_EQ(LXGetError(locale_), expected.size() > 1 ? number(expected[1]) : int64_t{LX_OK});
    }
  }

  const std::vector<TinyCodepage> codepages_ = line_codepages();
  TinyLibrary library_{codepages_};
  std::unique_ptr<Peer> peer_;
  LXLocale* locale_ = nullptr;
  LXStream* stream_ = nullptr;
};

TEST_F(StreamScript, EveryCallAnswersAsWritten) {
  size_t lines = 0;
  std::ifstream in(LEXICOR_DATA_DIR "/../tests/cases/stream/steps.txt");
  for (std::string line; std::getline(in, line);) {
    SCOPED_TRACE(std::to_string(++lines) + ": " + line);
    const std::vector<std::string> words = words_of(line);
    if (!words.empty() && words[0][0] != '#') run(words);
    if (HasFatalFailure()) return;
  }
  EXPECT_GT(lines, 0U);
}

}  // namespace
