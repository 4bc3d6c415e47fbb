// lexicor sort: sorts the lines of a text by a locale's sort. The text is held in memory; lines are views of
// it.
#include <lx.h>

#include <algorithm>
#include <cstring>
#include <deque>
#include <functional>
#include <memory>
#include <string_view>
#include <unordered_set>
#include <vector>

#include "arguments.h"
#include "collation.h"
#include "command.h"
#include "input.h"
#include "output.h"
#include "pieces.h"
#include "progress.h"

namespace lexicor_cli {

namespace {

constexpr char kUniqueBytes[] = "bytes", kUniqueOrder[] = "order";

struct SortOptions {
  std::string locale;  // empty: the user's
  std::string rules;   // a file; empty: the locale's sort
  std::string codepage = "UTF-8";
  std::string output = "-";
  bool key = false;
  bool ignore_case = false;
  bool reverse = false;
  std::string unique;  // kUniqueBytes or kUniqueOrder; empty: every line is written
  std::vector<std::string> files;

  uint32_t options() const { return ignore_case ? LX_CASE_INSENSITIVE : 0; }
};

/// The beginning of a key. Most lines differ in it, so that few whole keys are looked at.
class KeyHead {
 public:
  KeyHead() = default;
  /// What is beyond the end counts as zeros.
  explicit KeyHead(std::string_view key) {
    for (size_t i = 0; i < std::min(key.size(), sizeof words_); ++i)
      words_[i / kWordBytes] |= uint64_t{static_cast<uint8_t>(key[i])} << 8 * (kWordBytes - 1 - i % kWordBytes);
  }

  /// Below 0, 0 or above 0.
  int compare(const KeyHead& other) const {
    for (size_t i = 0; i < kWords; ++i) {
      if (words_[i] != other.words_[i]) return words_[i] < other.words_[i] ? -1 : 1;
    }
    return 0;
  }

 private:
  static constexpr size_t kWords = 4, kWordBytes = sizeof(uint64_t);

  uint64_t words_[kWords] = {};
};

struct Line {
  std::string_view whole;  // with its end, as it is written
  std::string_view order;  // what is compared: the text without its end, or its key
  KeyHead head;            // in binary order all the same
};

/// The lines of a text, of which every file ends its last one.
class Lines {
 public:
  Lines(const Codepage& codepage, const Input& input, const std::string& text)
      : codepage_(codepage),
        input_(input),
        text_(text),
        feed_(static_cast<char>(LXCpUnicodeToCharW(codepage.object(), '\n'))),
        carriage_return_(static_cast<char>(LXCpUnicodeToCharW(codepage.object(), '\r'))),
        end_(1, feed_) {
    const std::vector<uint64_t> starts = input.starts();
    for (size_t i = 0; i < starts.size(); ++i) {
      const auto end = static_cast<size_t>(i + 1 < starts.size() ? starts[i + 1] : text.size());
      for (auto at = static_cast<size_t>(starts[i]); at < end;) at = take(at, end);
    }
  }

  std::vector<Line>& lines() { return lines_; }

 private:
  /// Takes the line that begins at `begin`, in a file that ends at `file_end`; returns where the next one
  /// begins.
  size_t take(size_t begin, size_t file_end) {
    const size_t feed = find_feed(begin, file_end);
    const bool ended = feed < file_end;
    const size_t next = ended ? feed + 1 : file_end;
    const bool two = ended && feed > begin && text_[feed - 1] == carriage_return_;
    const size_t end = two ? feed - 1 : ended ? feed : file_end;
    Line line{view(begin, next), view(begin, end), {}};
    if (codepage_.call_bytes(line.order.data(), line.order.size()) != line.order.size())
      line.order = keep(joined(line.order));
    LXShiftState state;
    const size_t whole = codepage_.whole_bytes(line.order.data(), line.order.size(), LX_SHIFT_SINGLE, &state);
    if (whole != line.order.size()) throw_cut(end - (line.order.size() - whole), ended);
    if (ended) {
      end_ = std::string(view(end, next));
    } else {
      std::string closed(line.whole);
      if (state == LX_SHIFT_DOUBLE) closed += codepage_.shift_byte(LX_SHIFT_SINGLE);
      line.whole = keep(closed + end_);
    }
    lines_.push_back(line);
    return next;
  }

  /// The line feed, which in a shift-sensitive codepage stands in the single-byte state, or `end`. No other
  /// codepage has characters with a line feed in them.
  size_t find_feed(size_t at, size_t end) const {
    if (!codepage_.shift_sensitive()) {
      const void* const found = std::memchr(text_.data() + at, feed_, end - at);
      return found == nullptr ? end : static_cast<size_t>(static_cast<const char*>(found) - text_.data());
    }
    for (LXShiftState state = LX_SHIFT_SINGLE; at < end;) {
      if (codepage_.is_shift(text_[at])) {
        state = codepage_.state_after(text_[at++]);
      } else if (state == LX_SHIFT_SINGLE && text_[at] == feed_) {
        return at;
      } else {
        at += static_cast<size_t>(codepage_.char_bytes(&text_[at], state));
      }
    }
    return end;
  }

  /// A text without the shift bytes that change nothing: the library takes the second of two for a character.
  std::string joined(std::string_view text) const {
    std::string result;
    LXShiftState state = LX_SHIFT_SINGLE, written = LX_SHIFT_SINGLE;
    for (size_t at = 0; at < text.size();) {
      if (codepage_.is_shift(text[at])) {
        state = codepage_.state_after(text[at++]);
        continue;
      }
      if (state != written) result += codepage_.shift_byte(state);
      written = state;
      const auto bytes = static_cast<size_t>(codepage_.char_bytes(&text[at], state));
      result += text.substr(at, bytes);
      at += bytes;
    }
    return result;
  }

  [[noreturn]] void throw_cut(size_t offset, bool ended) const {
    if (!ended) throw input_.cut_at(offset);
    throw Failure(kDataError, "a line ends inside the character that begins at " + input_.locate(offset));
  }

  std::string_view view(size_t begin, size_t end) const {
    return std::string_view(text_).substr(begin, end - begin);
  }
  std::string_view keep(const std::string& text) { return kept_.emplace_back(text); }

  const Codepage& codepage_;
  const Input& input_;
  const std::string& text_;
  const char feed_;
  const char carriage_return_;
  std::string end_;               // of the line before; a last line without an end gets it
  std::deque<std::string> kept_;  // what is not in the text as it stands
  std::vector<Line> lines_;
};

/// The bar while lines are sorted: each pass over them is the same part of it.
class PassBar {
 public:
  PassBar(uint64_t text_bytes, uint64_t steps)
      : text_bytes_(text_bytes), steps_(steps), progress_(text_bytes, true, kWorthShowing) {}

  void advance(uint64_t steps) {
    done_ += steps;
    const auto shown = static_cast<uint64_t>(static_cast<double>(text_bytes_) * static_cast<double>(done_) /
                                             static_cast<double>(steps_));
    progress_.advance(shown - shown_);
    shown_ = shown;
  }

 private:
  // Sorting takes longer than reading.
  static constexpr uint64_t kWorthShowing = 1024 * 1024;

  uint64_t text_bytes_;
  uint64_t steps_;
  uint64_t done_ = 0;
  uint64_t shown_ = 0;
  Progress progress_;
};

/// Passes of a merge over runs that double their length.
uint64_t count_passes(size_t lines) {
  uint64_t passes = 0;
  for (size_t run = 1; run < lines; run *= 2) ++passes;
  return passes;
}

/// Sorts so that lines of which none is before the other keep their places. Merging ends also with an order
/// that contradicts itself, as a faulty sort object can give.
template <class Before>
void merge_sort(std::vector<Line>* lines, Before before, PassBar* bar) {
  const size_t count = lines->size();
  std::vector<Line> merged(count);
  for (size_t run = 1; run < count; run *= 2) {
    for (size_t at = 0; at < count; at += 2 * run) {
      Line* const begin = lines->data() + at;
      Line* const middle = begin + std::min(run, count - at);
      Line* const end = begin + std::min(2 * run, count - at);
      if (middle == end || !before(*middle, middle[-1]))
        std::copy(begin, end, &merged[at]);
      else
        std::merge(begin, middle, middle, end, &merged[at], before);
      bar->advance(static_cast<uint64_t>(end - begin));
    }
    lines->swap(merged);
  }
}

/// Gives each line the head of its key. With `keys`, which keeps the keys, the key takes the place of the text.
void make_keys(Collation& collation, uint32_t options, std::vector<Line>* lines, std::string* keys,
               const std::function<void()>& made_one) {
  std::vector<size_t> ends;
  std::string key;
  for (Line& line : *lines) {
    key.clear();
    collation.append_key(line.order, options, &key);
    line.head = KeyHead(key);
    if (keys != nullptr) {
      *keys += key;
      ends.push_back(keys->size());
    }
    made_one();
  }
  size_t begin = 0;
  for (size_t i = 0; i < ends.size(); begin = ends[i++])
    (*lines)[i].order = std::string_view(*keys).substr(begin, ends[i] - begin);
}

/// Writes the lines that `keeps` tells of.
template <class Keeps>
void write_lines(const std::vector<Line>& lines, Output& output, Keeps keeps) {
  std::string buffer;
  for (const Line& line : lines) {
    if (!keeps(line)) continue;
    buffer += line.whole;
    if (buffer.size() < Pieces::kBytes) continue;
    output.write(buffer);
    buffer.clear();
  }
  output.write(buffer);
}

int sort(const SortOptions& options, const CommonOptions& common) {
  RulesSession session(common, options.rules);
  Collation collation(session, options.locale, options.codepage);
  Input input(options.files);
  Pieces pieces(input);
  Output output(options.output);
  std::string text;
  text.reserve(static_cast<size_t>(input.total_bytes()));
  pieces.each(true, [&](const char* data, size_t bytes) { text.append(data, bytes); });
  Lines split(collation.codepage(), input, text);
  std::vector<Line>& lines = split.lines();
  std::string keys;
  const bool by_key = collation.by_key(options.options());
  const bool keeps_keys = by_key && options.key;
  const auto compare = [&](const Line& a, const Line& b) {
    if (const int result = a.head.compare(b.head)) return result;
    return keeps_keys ? a.order.compare(b.order) : collation.compare(a.order, b.order, options.options());
  };
  const uint64_t passes = count_passes(lines.size());
  {
    PassBar bar(text.size(), lines.size() * (by_key ? 2 * passes : passes));
    if (by_key) {
      make_keys(collation, options.options(), &lines, keeps_keys ? &keys : nullptr,
                [&] { bar.advance(passes); });
    }
    if (options.reverse)
      merge_sort(
          &lines, [&](const Line& a, const Line& b) { return compare(b, a) < 0; }, &bar);
    else
      merge_sort(
          &lines, [&](const Line& a, const Line& b) { return compare(a, b) < 0; }, &bar);
  }
  std::unordered_set<std::string_view> written;
  const Line* last = nullptr;
  write_lines(lines, output, [&](const Line& line) {
    if (options.unique == kUniqueBytes) return written.insert(line.whole).second;
    const bool keeps = options.unique.empty() || last == nullptr || compare(*last, line) != 0;
    if (keeps) last = &line;
    return keeps;
  });
  output.commit();
  return kDone;
}

}  // namespace

Run declare_sort(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<SortOptions>();
  command.add_option("--locale", options->locale, "locale whose sort is used; else the user's locale")
      .type_name("LOCALE");
  add_rules_option(command, options->rules);
  command.add_option("--codepage", options->codepage, "codepage of the text; else UTF-8").type_name("CP");
  command.add_flag("--key", options->key,
                   "keep the key of every line and compare those: faster, takes more memory, same result");
  command.add_flag("--case-insensitive", options->ignore_case, "letter case does not count");
  command.add_flag("--reverse", options->reverse, "last ones first; equal lines still keep their order");
  command.add_flag(
      "--unique", options->unique, {kUniqueBytes, kUniqueOrder},
      "of lines that are the same bytes, or with =order of those that the order calls equal, write "
      "the first only");
  command.add_option("-o,--output", options->output, "output file, replaced when it is complete")
      .type_name("OUT");
  command.add_option("FILE", options->files, "input files; - is standard input").type_name("");
  command.footer(
      "A line ends with a line feed, or with a carriage return and one, which do not count. Lines that the "
      "order\n"
      "calls equal stay as they were one behind the other. A last line without an end gets that of the line "
      "before it.\n"
      "--unique alone counts line ends as bytes of the line.\n"
      "\n"
      "Examples:\n"
      "  lexicor sort --locale Swedish names.txt\n"
      "  lexicor sort --locale Japanese@Japanese --codepage MS932 --unique -o words.txt words.txt");
  return [options, &common] { return sort(*options, common); };
}

}  // namespace lexicor_cli
