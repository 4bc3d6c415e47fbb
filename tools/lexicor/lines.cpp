// lexicor lines: rewrites the line ends of a text in a codepage, by the library's character streams.
#include <lx.h>

#include <algorithm>
#include <exception>
#include <iostream>
#include <map>
#include <memory>

#include "arguments.h"
#include "catalogue.h"
#include "codepage.h"
#include "command.h"
#include "input.h"
#include "output.h"
#include "pieces.h"
#include "progress.h"
#include "session.h"
#include "well_formed.h"

namespace lexicor_cli {

namespace {

constexpr int32_t kLineCodes = 4096;  // of a longer line as many at a time
constexpr size_t kMostEolCodes = 5;

const std::map<std::string, uint32_t> kLineEnds = {
    {"lf", LX_EOL_LF}, {"crlf", LX_EOL_CRLF}, {"nl", LX_EOL_THIRD}, {"other", LX_EOL_FOURTH}};

struct LinesOptions {
  std::string from, eol, output = "-";
  std::vector<std::string> find;  // empty: all kinds
  bool report = false;
  std::vector<std::string> files;
};

/// The far end of a stream. Exceptions do not pass through the library: they wait here.
class Peer {
 public:
  Peer() = default;
  virtual ~Peer() = default;
  Peer(const Peer&) = delete;
  Peer& operator=(const Peer&) = delete;

  static int32_t transfer(void* user, char* buffer, int32_t bytes) {
    Peer& peer = *static_cast<Peer*>(user);
    if (peer.error_) return -1;
    try {
      return static_cast<int32_t>(peer.move(buffer, static_cast<size_t>(bytes)));
    } catch (...) {
      peer.error_ = std::current_exception();
      return -1;
    }
  }
  void rethrow() const {
    if (error_) std::rethrow_exception(error_);
  }

 private:
  virtual size_t move(char* buffer, size_t bytes) = 0;

  std::exception_ptr error_;
};

class Source : public Peer {
 public:
  /// Reads the first piece: when this stands before the output is opened, a missing input leaves no trace.
  Source(Input& input, const Codepage& codepage)
      : input_(input), check_(codepage, input), piece_(Pieces::kBytes) {
    read();
  }

  void show(Progress& progress) { progress_ = &progress; }

 private:
  size_t move(char* buffer, size_t bytes) override {
    if (at_ == got_ && got_ != 0) {
      if (progress_ != nullptr) progress_->advance(got_);
      read();
    }
    const size_t count = std::min(bytes, got_ - at_);
    std::copy_n(piece_.data() + at_, count, buffer);
    at_ += count;
    return count;
  }

  /// Reads the next piece. A stream takes characters by their first bytes: malformed text does not come to it.
  void read() {
    at_ = 0;
    got_ = input_.read(piece_.data(), piece_.size());
    if (got_ > 0)
      check_.take(piece_.data(), got_);
    else
      check_.finish();
  }

  Input& input_;
  WellFormed check_;
  Progress* progress_ = nullptr;
  std::vector<char> piece_;
  size_t got_ = 0;  // 0 at the end of the input
  size_t at_ = 0;
};

class Target : public Peer {
 public:
  explicit Target(Output& output) : output_(output) {}
  /// Writes what has been gathered.
  void flush() {
    output_.write(text_);
    text_.clear();
  }

 private:
  size_t move(char* buffer, size_t bytes) override {
    text_.append(buffer, bytes);
    if (text_.size() >= Pieces::kBytes) flush();
    return bytes;
  }

  Output& output_;
  std::string text_;
};

/// A stream of the library over its far end.
class Stream {
 public:
  Stream(LXLocale* locale, Peer& peer, uint32_t mode)
      : locale_(locale), peer_(peer), stream_(LXOpenStream(locale, Peer::transfer, &peer, mode)) {
    if (stream_ == nullptr) fail();
  }
  ~Stream() {
    if (stream_ != nullptr) LXCloseStream(stream_, locale_);
  }
  Stream(const Stream&) = delete;
  Stream& operator=(const Stream&) = delete;

  LXStream* get() const { return stream_; }
  void write(LXWChar code) {
    if (LXWriteCharW(stream_, locale_, code, 0) == 0) fail();
  }
  void close() {
    LXStream* const stream = stream_;
    stream_ = nullptr;
    if (LXCloseStream(stream, locale_) == 0) fail();
  }
  /// Throws what happened at the far end, or else what the library says.
  [[noreturn]] void fail() const {
    peer_.rethrow();
    throw Failure(kDataError, "the stream failed: " + describe_code(LXGetError(locale_)));
  }

 private:
  LXLocale* locale_;
  const Peer& peer_;
  LXStream* stream_;
};

class Rewriter {
 public:
  Rewriter(const Codepage& codepage, uint32_t find, uint32_t eol) : locale_(codepage.locale()), find_(find) {
    LXWChar* const end = LXPutEolW(locale_, eol_, eol);
    eol_codes_ = end - eol_;
  }

  /// Rewrites all lines: LX_OK, or the code that ended the reading too early.
  int32_t run(Stream& in, Stream& out) {
    std::vector<LXWChar> line(kLineCodes);
    for (;;) {
      const int32_t count = LXReadStringW(in.get(), locale_, line.data(), kLineCodes, find_);
      if (count < 0) return LXGetError(locale_);
      uint32_t kind = LX_EOL_NONE;
      int32_t eol_codes = 0;
      const LXWChar* const past = LXGetEolW(locale_, line.data(), count, &kind, &eol_codes, find_);
      const LXWChar* const end = line.data() + count - eol_codes;
      for (const LXWChar* p = line.data(); p != end; ++p) out.write(*p);
      if (past == nullptr) continue;
      for (const LXWChar* p = eol_; p != eol_ + eol_codes_; ++p) out.write(*p);
      ++found_[kind];
      if (!std::equal(end, past, eol_, eol_ + eol_codes_)) ++rewritten_;
    }
  }

  /// "lexicor: 3 line ends (2 crlf, 1 lf), 2 rewritten".
  void report() const {
    uint64_t all = 0;
    std::string kinds;
    for (const auto& [name, kind] : kLineEnds) {
      const auto found = found_.find(kind);
      if (found == found_.end()) continue;
      all += found->second;
      kinds += (kinds.empty() ? " (" : ", ") + std::to_string(found->second) + " " + name;
    }
    std::cerr << "lexicor: " << all << (all == 1 ? " line end" : " line ends") << kinds
              << (kinds.empty() ? "" : ")") << ", " << rewritten_ << " rewritten\n";
  }

 private:
  LXLocale* locale_;
  const uint32_t find_;
  LXWChar eol_[kMostEolCodes] = {};
  ptrdiff_t eol_codes_;
  std::map<uint32_t, uint64_t> found_;  // by kind
  uint64_t rewritten_ = 0;
};

int rewrite_lines(const LinesOptions& options, const CommonOptions& common) {
  const Session session(common);
  const Codepage codepage(session, read_catalogue(), options.from);
  uint32_t find = options.find.empty() ? LX_EOL_ALL : 0;
  for (const std::string& name : options.find) find |= kLineEnds.at(name);
  Input input(options.files);
  Source source(input, codepage);
  Output output(options.output);
  Target target(output);
  Progress progress(input.total_bytes(), !output.is_terminal());
  source.show(progress);
  Stream in(codepage.locale(), source, LX_STREAM_READ);
  Stream out(codepage.locale(), target, LX_STREAM_WRITE);
  Rewriter rewriter(codepage, find, kLineEnds.at(options.eol));
  const int32_t code = rewriter.run(in, out);
  source.rethrow();
  out.close();
  target.flush();
  if (code != LX_OK) in.fail();
  output.commit();
  if (options.report) rewriter.report();
  return kDone;
}

}  // namespace

Run declare_lines(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<LinesOptions>();
  command.add_option("--from", options->from, "codepage of the text: a name, an identifier or an alias")
      .required()
      .type_name("CP");
  command
      .add_option(
          "--eol", options->eol,
          "line end to write: lf, crlf, nl (new line of EBCDIC), or other (a fourth one of the codepage)")
      .required()
      .type_name("KIND")
      .one_of(keys_of(kLineEnds));
  command.add_option("--find", options->find, "line ends to rewrite, separated by commas; else all four kinds")
      .type_name("KIND,...")
      .divided_by(',')
      .one_of(keys_of(kLineEnds));
  command.add_flag("--report", options->report, "say on standard error how many line ends there were");
  command.add_option("-o,--output", options->output, "output file, replaced when it is complete")
      .type_name("OUT");
  command.add_option("FILE", options->files, "input files, taken as one text; - is standard input")
      .type_name("");
  command.footer(
      "The bytes of a line end are the codepage's own. In most codepages nl and other are the line feed; in "
      "EBCDIC\n"
      "nl is 0x15. A carriage return alone is no line end. Nothing but line ends is changed, except that "
      "shift\n"
      "bytes that change nothing are left out. Malformed text is refused: its place is shown, OUT stays as it "
      "was, and\n"
      "the exit code is 1.\n"
      "\n"
      "Examples:\n"
      "  lexicor lines --from UTF-8 --eol lf -o letter.unix letter.txt\n"
      "  lexicor lines --from IBM939 --eol nl --find lf,crlf --report < host.txt > host.nl");
  return [options, &common] { return rewrite_lines(*options, common); };
}

}  // namespace lexicor_cli
