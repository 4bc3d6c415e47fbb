// The family of stream.txt: the calls of a stream one after the other, and what each answers.
#include <functional>
#include <sstream>

#include "cases/case_runner.h"
#include "stream/stream_peer.h"

namespace lx::test {

namespace {

/// A number, or names joined by "+".
int64_t number(const std::string& text) {
  static const std::map<std::string, int64_t> kNames{
      {"END", LX_STREAM_END},        {"FAILURE", LX_STREAM_FAILURE}, {"NO_UNIT", LX_STREAM_NO_UNIT},
      {"nonsense", Peer::kNonsense}, {"crlf", LX_EOL_CRLF},          {"lf", LX_EOL_LF},
      {"drop", LX_DROP_RETURNS},     {"chars", LX_CHARACTERS},       {"terminate", LX_TERMINATE}};
  const size_t plus = text.find('+');
  if (plus != std::string::npos) return number(text.substr(0, plus)) | number(text.substr(plus + 1));
  const auto found = kNames.find(text);
  return found != kNames.end() ? found->second : std::stoll(text, nullptr, 0);
}
/// "A*N,B": A so many times, then B.
std::vector<int32_t> numbers(const std::string& list) {
  std::vector<int32_t> all;
  std::istringstream in(list);
  for (std::string part; std::getline(in, part, ',');) {
    const size_t star = part.find('*');
    const size_t times = star == std::string::npos ? 1 : std::stoul(part.substr(star + 1));
    all.insert(all.end(), times, static_cast<int32_t>(number(part.substr(0, star))));
  }
  return all;
}

struct StreamCalls {
  CaseRun<Ex>& r;
  Peer peer{false};
  LXStream* stream = nullptr;

  /// What a call answers.
  int64_t call(const std::string& name, const CaseWords::Word& word) {
    const std::string bytes = word.text.bytes(r.cp);
    const std::vector<char> exact(bytes.begin(), bytes.end());
    const auto code = [&] { return static_cast<LXWChar>(number(word.value)); };
    const std::map<std::string, std::function<int64_t()>> calls{
        {"readW", [&] { return int64_t{LXReadCharW(stream, r.l)}; }},
        {"readU", [&] { return int64_t{LXReadCharU(stream, r.l)}; }},
        {"unget", [&] { return LXUngetChar(stream, r.l, exact.data()); }},
        {"ungetEx", [&] { return LXUngetCharEx(stream, r.l, exact.data(), 1); }},
        {"ungetW", [&] { return LXUngetCharW(stream, r.l, code()); }},
        {"ungetU", [&] { return LXUngetCharU(stream, r.l, static_cast<LXUChar>(code())); }},
        {"write", [&] { return LXWriteChar(stream, r.l, exact.data()); }},
        {"writeEx", [&] { return LXWriteCharEx(stream, r.l, exact.data(), 1, 0); }},
        {"writeW", [&] { return LXWriteCharW(stream, r.l, code(), 0); }},
        {"flush", [&] { return LXFlushStream(stream, r.l); }},
        {"close", [&] { return LXCloseStream(stream, r.l); }},
        {"calls", [&] { return static_cast<int64_t>(peer.calls); }}};
    const auto found = calls.find(name);
    if (found == calls.end()) throw CaseError("no call of a stream: " + name);
    return found->second();
  }
  void answer(int64_t got, const std::string& expected) {
    const size_t slash = expected.find('/');
    EXPECT_EQ(got, number(expected.substr(0, slash)));
    EXPECT_EQ(LXGetError(r.l),
              slash != std::string::npos ? number(expected.substr(slash + 1)) : int64_t{LX_OK});
  }

  /// A string: its text, and with LX_CHARACTERS how many they are; or an answer.
  void line(decltype(LXReadString)* read, int32_t size, uint32_t flags) {
    const bool characters = (flags & LX_CHARACTERS) != 0;
    std::string block(static_cast<size_t>(size) * (characters ? 4 : 1), '#');
    block.shrink_to_fit();
    const int32_t n = read(stream, r.l, block.data(), size, flags);
    const size_t behind = block.find_last_not_of('#') + 1;
    EXPECT_TRUE(characters || behind == static_cast<size_t>(std::max(n, 0)));
    if (n < 0) return answer(n, r.expected().word());
    r.text({block.begin(), characters ? std::find(block.begin(), block.end(), '#') : block.begin() + n});
    if (characters) r.number(n);
  }

  void run(const CaseWords::Word& word) {
    const size_t star = word.name.find('*') + 1;
    const std::string name = word.name.substr(star);
    if (name == "reader" || name == "writer") {
      peer = {name == "reader", word.text.bytes(r.cp)};
      stream = LXOpenStream(r.l, Peer::transfer, &peer, peer.sends ? LX_STREAM_READ : LX_STREAM_WRITE);
    } else if (name == "far") {
      peer.script.resize(peer.calls);
      for (const int32_t step : numbers(word.value)) peer.script.push_back(step);
    } else if (name == "sent") {
      r.text({peer.bytes.begin(), peer.bytes.end()});
      peer.bytes.clear();
    } else if (name == "line" || name == "lineEx") {
      const std::vector<int32_t> arguments = numbers(word.value);
      for (int64_t n = star != 0 ? number(word.name.substr(0, star - 1)) : 1; n > 0; --n)
        line(name == "line" ? LXReadString : LXReadStringEx, arguments.at(0),
             static_cast<uint32_t>(arguments.at(1)));
    } else {
      const std::string expected = r.expected().word();
      for (int64_t n = star != 0 ? number(word.name.substr(0, star - 1)) : 1; n > 0; --n)
        answer(call(name, word), expected);
    }
  }
};

}  // namespace

Families stream_families() {
  return {{"calls",
           {nullptr,
            [](CaseRun<Ex>& r) {
              StreamCalls calls{r};
              for (const CaseWords::Word& word : r.given().all) calls.run(word), word.used = true;
            },
            nullptr, nullptr}}};
}

}  // namespace lx::test
