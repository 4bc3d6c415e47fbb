// Conversion by every choice of loops, compared with characters that are moved one by one: random texts, whole and
// broken, between memory that ends where they end, into room that is too small, exact or large.
#include <sys/mman.h>
#include <unistd.h>

#include <random>

#include "codepage/lxtext.h"
#include "codepage/lxvector.h"
#include "support/case_test.h"
#include "support/slowness.h"

namespace lx::test {
namespace {

/// Memory of `size` units with what cannot be touched behind it.
template <class Unit>
class Ending {
 public:
  explicit Ending(size_t size) : page_(static_cast<size_t>(sysconf(_SC_PAGESIZE))) {
    bytes_ = (size * sizeof(Unit) / page_ + 2) * page_;
    block_ =
        static_cast<char*>(mmap(nullptr, bytes_, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0));
    mprotect(block_ + bytes_ - page_, page_, PROT_NONE);
  }
  Ending(const Ending&) = delete;
  ~Ending() { munmap(block_, bytes_); }
  /// So many units at the end.
  Unit* last(size_t units) { return reinterpret_cast<Unit*>(block_ + bytes_ - page_) - units; }

 private:
  size_t page_, bytes_;
  char* block_;
};

class AllVectors : public CaseTest {
 protected:
  static constexpr size_t kMostUnits = 1500, kMostBytes = 4 * kMostUnits;
  static constexpr char kUntouched = 0x55;

  ~AllVectors() override { vectors = used_; }

  size_t below(size_t limit) { return random_() % limit; }
  const TinyCodepage& any_codepage() { return case_codepages()[below(case_codepages().size())]; }

  /// ASCII, characters of the codepage and stray bytes in pieces.
  std::string text_of(const TinyCodepage& cp) {
    std::string text;
    const size_t size = below(12) == 0 ? below(kMostUnits) : below(100);
    while (text.size() < size) {
      const size_t count = 1 + below(below(3) == 0 ? 70 : 5);
      std::vector<uint16_t> piece;
      const bool ascii = below(3) == 0;
      for (size_t i = 0; i < count; ++i)
        piece.push_back(ascii ? static_cast<uint16_t>(' ' + below(90)) : unit_of(cp));
      text += cp.encode(piece);
      if (below(100) == 0) text += static_cast<char>(below(256));
    }
    text.resize(size);
    if (below(4) == 0)
      for (char& byte : text)
        if (below(8) == 0) byte = static_cast<char>(0x0E + below(2));  // shift bytes side by side
    if (below(3) == 0)
      for (size_t i = 0; i < size; ++i)
        if (below(40) == 0) text[i] = static_cast<char>(0xC0 + below(0x40));
    return text;
  }
  uint16_t unit_of(const TinyCodepage& cp) {
    const uint16_t most = below(2) == 0 ? 0x7FF : 0xFFFF;
    if (cp.file.name == "UTF8" || below(50) == 0) return static_cast<uint16_t>(below(most) + 1);
    return cp.characters[below(cp.characters.size())].unicode;
  }

  /// What a call writes that has room for `size` units; behind them, and behind the result, it writes nothing.
  template <class Unit, class Call>
  std::vector<Unit> written(size_t size, const Call& call) {
    static Ending<Unit> memory(4 * kMostBytes);
    Unit* const out = memory.last(size);
    std::fill_n(reinterpret_cast<char*>(out), size * sizeof(Unit), kUntouched);
    const int32_t units = call(out, static_cast<int32_t>(size));
    EXPECT_LE(units, static_cast<int32_t>(size));
    const std::vector<Unit> result(out, out + units);
    const auto* const rest = reinterpret_cast<const char*>(out + units);
    EXPECT_EQ(std::count(rest, rest + (size - result.size()) * sizeof(Unit), kUntouched),
              static_cast<ptrdiff_t>((size - result.size()) * sizeof(Unit)))
        << "untouched behind " << units;
    return result;
  }

  /// Expects that each choice of loops writes what characters that are moved one by one give.
  template <class Unit, class In, class Call>
  void expect_as_single(const TinyCodepage& from, const TinyCodepage& to, const std::vector<In>& text,
                        const Call& call) {
    static Ending<In> memory(kMostBytes);
    In* const input = memory.last(text.size());
    std::copy(text.begin(), text.end(), input);
    const std::vector<Unit> whole = single<Unit>(from, to, input, text.size(), kMostBytes);
    const size_t sizes[] = {whole.size(), whole.size() + 70, below(whole.size() + 1), 3 * whole.size() + 5};
    for (const size_t size : sizes) {
      const std::vector<Unit> expected = single<Unit>(from, to, input, text.size(), size);
      const Vectors* choices[kMostVectors];
      for (size_t n = vectors_here(choices); n-- > 0;) {
        vectors = choices[n];
        ASSERT_EQ(written<Unit>(size,
                                [&](Unit* out, int32_t room) {
                                  return call(out, room, input, static_cast<int32_t>(text.size()));
                                }),
                  expected)
            << vectors->name << ", " << from.file.name << " to " << to.file.name << ", " << text.size()
            << " units into " << size;
      }
    }
  }

  /// The same of the characters that are counted.
  void expect_count_as_single(const TinyCodepage& cp, const std::string& text) {
    static Ending<char> memory(kMostBytes);
    char* const input = memory.last(text.size());
    std::copy(text.begin(), text.end(), input);
    LXLocale* const l = library.locale(cp);
    const Codepage& tables = codepage_of(*l->codepage);
    int32_t chars = 0;
    for (size_t at = 0; at < text.size(); ++chars) {
      at += tables.length(bytes_of(input)[at]);
      if (at > text.size()) break;
    }
    const Vectors* choices[kMostVectors];
    for (size_t n = vectors_here(choices); n-- > 0;) {
      vectors = choices[n];
      ASSERT_EQ(LXNumChars(l, input, static_cast<int32_t>(text.size())), chars)
          << vectors->name << ", " << cp.file.name << ", " << text.size() << " bytes";
    }
  }

  template <class Unit, class In>
  std::vector<Unit> single(const TinyCodepage& from, const TinyCodepage& to, const In* text, size_t units,
                           size_t size) {
    const Codepage& in_cp = codepage_of(*library.locale(from)->codepage);
    const Codepage& out_cp = codepage_of(*library.locale(to)->codepage);
    std::vector<Unit> out(size + 1);
    size_t count = 0;
    with_cursor(in_cp, Form::kEx, LX_SHIFT_SINGLE, text, units, [&](auto in) {
      with_sink(out_cp, Form::kEx, LX_SHIFT_SINGLE, out.data(), out.data() + size, [&](auto sink) {
        LXUChar value;
        while (in.next(&value) && sink.put(value)) continue;
        count = room(out.data(), sink.p);
      });
    });
    out.resize(count);
    return out;
  }

 private:
  const Vectors* const used_ = vectors;
  std::mt19937 random_{20261123};
};

TEST_F(AllVectors, WriteWhatSingleCharactersGive) {
  for (int round = 0; round < 8000 / kSlowness && !HasFailure(); ++round) {
    const TinyCodepage &from = any_codepage(), &to = any_codepage();
    LXLocale *const source = library.locale(from), *const target = library.locale(to);
    const std::string text = text_of(from);
    const std::vector<uint8_t> bytes(text.begin(), text.end());
    expect_count_as_single(from, text);
    std::vector<LXUChar> values;
    for (size_t n = text.size(); n > 0; --n) values.push_back(below(3) == 0 ? 'x' : unit_of(to));
    expect_as_single<LXUChar>(from, from, bytes, [&](LXUChar* out, int32_t size, const uint8_t* in, int32_t n) {
      return LXStringToUnicodeEx(out, size, source, chars_of(in), LX_SHIFT_SINGLE, n, 0);
    });
    expect_as_single<uint8_t>(to, to, values, [&](uint8_t* out, int32_t size, const LXUChar* in, int32_t n) {
      return LXUnicodeToStringEx(target, chars_of(out), LX_SHIFT_SINGLE, size, in, n, 0);
    });
    expect_as_single<uint8_t>(from, to, bytes, [&](uint8_t* out, int32_t size, const uint8_t* in, int32_t n) {
      return LXConvertStringEx(target, chars_of(out), LX_SHIFT_SINGLE, size, source, chars_of(in),
                               LX_SHIFT_SINGLE, n, 0);
    });
  }
}

/// Blocks of ASCII are passed whole: not where a character of the block before takes a byte of them.
TEST_F(AllVectors, CountWhatABlockCuts) {
  for (const TinyCodepage& cp : case_codepages())
    for (unsigned byte = 0x80; byte < 0x100; ++byte)
      for (const size_t at : {62u, 63u})
        expect_count_as_single(cp, std::string(at, 'a') + static_cast<char>(byte) + std::string(140, 'a'));
}

}  // namespace
}  // namespace lx::test
