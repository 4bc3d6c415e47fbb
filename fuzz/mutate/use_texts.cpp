#include <algorithm>

#include "use.h"

namespace mutate {
namespace {

using lx::test::Ex;
using lx::test::Plain;
using lx::test::Text;
using lx::test::Unicode;
using lx::test::Units;
using lx::test::Wide;

// A character of the double-byte state may have a shift byte on each side.
constexpr size_t kMostUnits = 6;

constexpr uint32_t kMapModes[] = {LX_MAP_FULL_WIDTH, LX_MAP_HALF_WIDTH,   LX_MAP_COPY,         LX_MAP_LOWER,
                                  LX_MAP_UPPER,      LX_MAP_LOWER_SIMPLE, LX_MAP_UPPER_SIMPLE, LX_MAP_DIGITS};
constexpr uint32_t kOptions[] = {0, LX_CASE_INSENSITIVE, LX_WIDTH_INSENSITIVE, LX_IGNORE_BLANKS};

/// Values that the directory's objects know, and others.
Units some_values(Random& random) {
  static const Units known = [] {
    Units all = lx::test::units("aAbBcChHeEsSqQijyz12-+ .,?!");
    for (const unsigned u : {0xDF, 0xE6, 0x301, 0x20AC, 0x3000, 0x3041, 0x3042, 0x30A1, 0x4E9C, 0x4E02, 0x5186,
                             0xFF11, 0xFF21, 0xFF41, 0xFF61, 0xFF71})
      all.push_back(static_cast<LXUChar>(u));
    return all;
  }();
  Units values;
  for (size_t left = random() % 24; left > 0; --left)
    values.push_back(random() % 4 != 0 ? known[random() % known.size()] : static_cast<LXUChar>(random()));
  return values;
}

/// A text of a form: characters of the locale, or anything.
template <class F>
Text<typename F::Unit> some_text(const F& form, LXLocale* l, Random& random) {
  using Unit = typename F::Unit;
  const Units values = some_values(random);
  if (random() % 3 != 0) return lx::test::encode(form, l, values);
  Text<Unit> text;
  const uint32_t masks[] = {0xFF, 0x7F, 0xFFFF, 0xFFFFFFFF};
  const uint32_t mask = masks[random() % 4];
  for (size_t i = 0; i < values.size(); ++i)
    text.push_back(static_cast<Unit>((random() ^ random() << 16) & mask));
  return text;
}

/// The functions of a form over texts that change from call to call.
template <class F>
class Texts {
 public:
  using Unit = typename F::Unit;
  static constexpr bool kBytes = sizeof(Unit) == 1;

  Texts(const F& form, LXLocale* locale, LXLocale* other, Random& random)
      : f_(form), l_(locale), other_(other), random_(random) {
    int32_t rc = LX_OK;
    const auto id = static_cast<uint16_t>(LXGetLocaleNumInfo(l_, LX_ITEM_CODEPAGE_ID, 0));
    codepage_ = LXGetObjFromID(nullptr, LX_CODEPAGE, id, LX_FIND_AND_LOAD, &rc);
  }

  void use() {
    strings();
    orders();
    conversions();
    numbers();
    times();
    items();
    lines();
    if constexpr (kBytes) characters();
  }

 private:
  struct Input {
    Exact<Unit> block;
    int32_t length;  // as it is given: units, characters, or -1
  };

  static bool counts_characters(uint32_t flags) { return kBytes && (flags & LX_CHARACTERS) != 0; }
  /// The fewest that a function counts: with shift states, from either on, and without.
  int32_t characters_of(const Text<Unit>& text) const {
    const auto units = static_cast<int32_t>(text.size());
    if constexpr (kBytes) {
      int32_t fewest = codepage_ != nullptr ? LXNumChars(l_, text.data(), units) : 0;
      for (const LXShiftState state : {LX_SHIFT_SINGLE, LX_SHIFT_DOUBLE})
        if (fewest > 0)
          fewest = std::min(fewest, lx::test::length_in_chars(codepage_, text.data(), state, units));
      return fewest;
    } else {
      return units;
    }
  }

  Text<Unit> text() { return some_text(f_, l_, random_); }
  Input input(uint32_t flags) { return input(flags, text()); }
  Input input(uint32_t flags, Text<Unit> all) {
    if (random_() % 4 == 0) {  // a text ends where the first null is
      all.resize(std::min(all.find(Unit{0}), all.size()));
      all.push_back(0);
      return {Exact<Unit>(all), -1};
    }
    if (!counts_characters(flags)) return {Exact<Unit>(all), static_cast<int32_t>(all.size())};
    // A number of characters is trusted, up to the byte behind the last one, which may be a shift byte.
    const int32_t chars = characters_of(all);
    all.push_back(0);
    return {Exact<Unit>(all), chars};
  }
  /// A flag, or none.
  uint32_t maybe(uint32_t flag) { return random_() % 2 == 0 ? flag : 0; }
  uint32_t count_flag() { return maybe(LX_CHARACTERS); }

  /// Calls `write` with a block for `size` units, or for that many characters; what it returns is no more than that.
  template <class Write>
  void output(uint32_t flags, const Write& write) {
    const size_t size = random_() % 48;
    const Exact<Unit> block(counts_characters(flags) ? size * kMostUnits + 1 : size);
    must(write(block.data(), static_cast<int32_t>(size)) <= static_cast<int64_t>(size),
         "no more is written than fits");
  }

  void strings() {
    const uint32_t flags = count_flag();
    const Input a = input(flags), b = input(flags);
    output(flags,
           [&](Unit* to, int32_t size) { return f_.cpy(l_, to, size, a.block.data(), a.length, flags); });
    output(flags,
           [&](Unit* to, int32_t size) { return f_.cat(l_, to, size, a.block.data(), a.length, flags); });
    f_.chr(l_, a.block.data(), a.length,
           static_cast<typename F::Char>(b.block.size() > 0 ? *b.block.data() : 1), flags);
    f_.spn(l_, a.block.data(), a.length, b.block.data(), b.length, flags);
    f_.cspn(l_, a.block.data(), a.length, b.block.data(), b.length, flags);
    f_.str(l_, a.block.data(), a.length, b.block.data(), b.length, kOptions[random_() % 3] | flags);
    Unit* rest = a.block.data();
    int32_t left = a.length;
    const LXShiftState state = lx::test::states.text;
    lx::test::states.result = state;
    for (int tokens = 0; rest != nullptr && tokens < 6; ++tokens) {
      Unit* const from = rest;
      f_.tok(l_, from, &left, b.block.data(), b.length, &rest, flags);
    }
    if constexpr (kBytes) {
      Text<Unit> whole = text();
      whole.push_back(0);
      const Exact<Unit> buffer(whole);
      f_.truncate(l_, buffer.data(), static_cast<int32_t>(random_() % whole.size()),
                  flags | (random_() % 2 == 0 ? LX_DROP_FULL_BLANKS : LX_DROP_BLANKS));
    }
  }

  void orders() {
    const uint32_t flags = std::is_same_v<F, Unicode> || std::is_same_v<F, Wide> ? 0 : count_flag();
    const uint32_t options = kOptions[random_() % 4] | flags;
    const Input a = input(flags), b = input(flags);
    f_.cmp(l_, a.block.data(), a.length, b.block.data(), b.length, options);
    f_.coll(l_, a.block.data(), a.length, b.block.data(), b.length, options);
    const Exact<uint8_t> key(random_() % 200);
    const Input c = input(flags);
    f_.xfrm(l_, key.data(), key.size(), c.block.data(), c.length, kOptions[random_() % 3] | flags);
    const Exact<Unit> whole(text());
    const Unit* at = whole.data();
    int32_t left = whole.size();
    uint16_t counter = 0;
    LXUChar ahead = LX_NO_LOOK_AHEAD;
    lx::test::states.result = lx::test::states.text;
    for (int i = 0; left > 0 && i < 100; ++i) {
      LXWeights first, second;
      uint8_t char_class = 0;
      f_.next_weight(l_, &at, &left, &counter, &first, &second, &char_class, &ahead);
      must(at <= whole.data() + whole.size(), "weights come from the text");
    }
  }

  void conversions() {
    const uint32_t flags = count_flag();
    for (const uint32_t mode : kMapModes) {
      const Input a = input(flags);
      output(flags, [&](Unit* to, int32_t size) {
        return f_.map(l_, to, size, a.block.data(), a.length, mode | flags);
      });
    }
    if constexpr (!std::is_same_v<F, Unicode>) {
      const uint32_t shared = (flags & (kBytes ? ~0u : 0u)) | maybe(LX_TERMINATE);
      const int32_t given = static_cast<int32_t>(shared);
      const Input a = input(shared);
      output(shared, [&](Unit* to, int32_t size) {
        return f_.convert(other_, to, size, l_, a.block.data(), a.length, given);
      });
      const Exact<LXUChar> values(some_values(random_));
      output(shared, [&](Unit* to, int32_t size) {
        return f_.encode(l_, to, size, values.data(), values.size(), given);
      });
      const Exact<LXUChar> units(random_() % 40);
      const Input b = input(shared);
      f_.decode(units.data(), units.size(), l_, b.block.data(), b.length, given);
    }
    if constexpr (kBytes) {
      const Exact<LXWChar> codes(random_() % 40);
      const Input a = input(flags);
      const int32_t count =
          f_.to_codes(l_, codes.data(), codes.size(), a.block.data(), a.length, static_cast<int32_t>(flags));
      output(flags, [&](Unit* to, int32_t size) {
        return f_.from_codes(l_, to, size, codes.data(), std::max(count, 0), static_cast<int32_t>(flags));
      });
      buffers();
    }
  }

  /// A streaming conversion, in pieces.
  void buffers() {
    LXConversion* const conversion = LXOpenConversion(other_, l_);
    must(conversion != nullptr, "a conversion opens");
    const Text<Unit> whole = text() + text();
    size_t at = 0;
    for (int steps = 0; steps < 40 && at < whole.size(); ++steps) {
      const Exact<Unit> in(whole.substr(at, random_() % 7));
      const Exact<Unit> out(random_() % 9);
      const char* from = in.data();
      char* to = out.data();
      int32_t from_left = in.size(), to_left = out.size();
      LXConvertBuffer(conversion, &to, &to_left, &from, &from_left);
      must(from_left >= 0 && to_left >= 0, "a conversion stays in its buffers");
      at += static_cast<size_t>(in.size() - from_left);
    }
    must(LXCloseConversion(conversion) == LX_OK, "a conversion closes");
    LXConversionRatio(other_, l_);
  }

  void numbers() {
    using lx::test::Value;
    const Value values[] = {{Value::kLong, -1234567890},    {Value::kLong, 4000000000.0, LX_UNSIGNED},
                            {Value::kDouble, -1.5e300},     {Value::kDouble, 0.25},
                            {Value::kAmount, -1234567.891}, {Value::kAmount, 0.5, LX_INTERNATIONAL}};
    for (Value value : values) {
      const uint32_t flags = maybe(LX_TERMINATE) | count_flag() | maybe(LX_TERRITORY_VALUES);
      output(flags, [&](Unit* to, int32_t size) { return lx::test::write(f_, l_, value, to, size, flags); });
      const Text<Unit> written = lx::test::write(f_, l_, value);
      lx::test::read(f_, l_, std::vector<Unit>(written.begin(), written.end()), value);
      const Text<Unit> any = text();
      std::vector<Unit> block(any.begin(), any.end());
      block.reserve(1);
      value.flags |= LX_NATIONAL_DIGITS;
      lx::test::read(f_, l_, block, value);
    }
    const Exact<Unit> grouping(text());
    int32_t remaining = grouping.size();
    const Unit* next = nullptr;
    f_.grouping_size(l_, grouping.data(), &remaining, &next);
    const Exact<Unit> sign(Text<Unit>(text(), 0, 1) + Unit{0});
    const Exact<Unit> digits(text());
    f_.digit(l_, digits.data(), digits.size(), &next, sign.data(), sign.data(), sign.data(), nullptr,
             LXGetLocaleNumInfo(l_, LX_ITEM_CODEPAGE_ASCII, 0), maybe(LX_NATIONAL_DIGITS));
  }

  void times() {
    constexpr LXTime kTime = {9, 5, 14, 21, 10, 126, 6, 324};
    for (const char* directives : {"%x", "%#x", "%X", "%c", "%A %B %p", "%a, %b%d %y|%I"}) {
      const Text<Unit> format = lx::test::encode(f_, l_, lx::test::units(directives));
      const Text<Unit> written = lx::test::write(f_, l_, kTime, format);
      const uint32_t flags = count_flag();
      const Input by = input(flags, format), text = input(flags, written);
      output(flags, [&](Unit* to, int32_t size) {
        return f_.write_time(l_, &kTime, to, size, by.block.data(), by.length, flags | LX_TERMINATE);
      });
      LXTime read = kTime;
      f_.read_time(l_, &read, text.block.data(), text.length, by.block.data(), by.length, flags);
    }
    const Exact<Unit> any(text());
    output(0, [&](Unit* to, int32_t size) {
      return f_.write_time(l_, &kTime, to, size, any.data(), any.size(), 0);
    });
  }

  void items() {
    // All of them, or some.
    const int32_t step = random_() % 8 == 0 ? 1 : 9;
    for (int32_t item = 1 + static_cast<int32_t>(random_() % 9) % step; item <= LX_ITEM_LOCALE_STRING;
         item += step) {
      const uint32_t flags = count_flag() | maybe(LX_TERRITORY_VALUES);
      output(flags, [&](Unit* to, int32_t size) {
        return f_.get_item(l_, item, to, size, static_cast<int32_t>(flags));
      });
      LXGetLocaleNumInfo(l_, item, static_cast<int32_t>(flags & LX_TERRITORY_VALUES));
    }
    const int32_t item = LX_ITEM_DECIMAL + static_cast<int32_t>(random_() % 23);
    const Input a = input(0);
    f_.set_item(l_, item, a.block.data(), a.length, 0);
  }

  void lines() {
    const uint32_t flags = count_flag();
    const Input a = input(flags);
    uint32_t kind = 0;
    int32_t eol_length = 0;
    f_.get_eol(l_, a.block.data(), a.length, &kind, &eol_length, LX_EOL_ALL | flags);
    const Exact<Unit> ends(5);
    f_.put_eol(l_, ends.data(), LX_EOL_ALL | LX_EOL_DEFAULT);

    Source source{{}, &random_};
    const Text<Unit> content = text() + text();
    source.bytes.assign(reinterpret_cast<const char*>(content.data()), content.size() * sizeof(Unit));
    LXStream* const stream = LXOpenStream(l_, Source::read, &source, LX_STREAM_READ);
    must(stream != nullptr, "a stream opens");
    for (int reads = 0; reads < 5; ++reads) {
      const uint32_t how = flags | (random_() % 2 == 0 ? LX_EOL_ALL : LX_DROP_RETURNS) | LX_TERMINATE;
      output(how, [&](Unit* to, int32_t size) { return f_.read_string(stream, l_, to, size, how); });
    }
    if (std::is_same_v<F, Unicode>)
      LXUngetCharU(stream, l_, LXReadCharU(stream, l_));
    else
      LXUngetCharW(stream, l_, LXReadCharW(stream, l_));
    LXCloseStream(stream, l_);
  }
  struct Source {
    std::string bytes;
    Random* random;

    static int32_t read(void* user, char* buffer, int32_t bytes) {
      Source& self = *static_cast<Source*>(user);
      const size_t n =
          std::min({self.bytes.size(), static_cast<size_t>(bytes), size_t{1 + (*self.random)() % 4}});
      std::copy_n(self.bytes.data(), n, buffer);
      self.bytes.erase(0, n);
      return static_cast<int32_t>(n);
    }
    static int32_t write(void* user, char*, int32_t bytes) {
      return (*static_cast<Source*>(user)->random)() % 4 != 0 ? bytes : 0;
    }
  };

  /// From character to character, and into a stream.
  void characters() {
    const Input a = input(0);
    const int32_t units = a.length < 0 ? a.block.size() - 1 : a.length;
    must(f_.count(l_, a.block.data(), a.length) <= units, "a character has a byte");
    const char* const end = f_.move(l_, a.block.data(), units, 0);
    must(end >= a.block.data() && end <= a.block.data() + units, "a walk ends in the text");
    Source sink{{}, &random_};
    LXStream* const stream = LXOpenStream(l_, Source::write, &sink, LX_STREAM_WRITE);
    must(stream != nullptr, "a stream opens");
    const Text<LXWChar> codes = some_text(lx::test::kWide, l_, random_);
    for (const LXWChar code : codes) LXWriteCharW(stream, l_, code, 0);
    LXFlushStream(stream, l_);
    LXCloseStream(stream, l_);
  }

  const F& f_;
  LXLocale* l_;
  LXLocale* other_;
  const LXObject* codepage_;
  Random& random_;
};

/// Moves the locale to the objects of the other one, with values of its own.
void change_locale(LXLocale* locale, LXLocale* other, Random& random) {
  for (const int32_t item : {LX_ITEM_DIGITS, LX_ITEM_CURRENCY_DIGITS, LX_ITEM_POSITIVE_POSITION})
    LXSetLocaleNumInfo(locale, item, static_cast<int32_t>(random() % 6));
  for (const int32_t item : {LX_ITEM_TERRITORY_ID, LX_ITEM_CODEPAGE_ID, LX_ITEM_SORT_ID})
    LXSetLocaleNumInfo(locale, item, LXGetLocaleNumInfo(other, item, 0));
  LXSetLocaleNumInfo(locale, LX_ITEM_TERRITORY_ID, 840);
  LXLocaleSetModifiable(locale);
  uint8_t digest[LX_DIGEST_BYTES];
  if (random() % 16 == 0)
    LXGetLocaleDigest(locale, static_cast<int32_t>(random() % 5) - 1, digest, sizeof(digest));
  for (LXUChar unit : some_values(random)) {
    LXUnicodeToLower(locale, unit), LXUnicodeToUpper(locale, unit);
    LXGetCharTypeU(locale, unit, LX_CTYPE1);
  }
}

}  // namespace

void use_texts(LXLocale* locale, LXLocale* other, Random& random, bool all_forms) {
  lx::test::states = {};
  if (random() % 2 == 0) lx::test::states.text = lx::test::states.second = LX_SHIFT_DOUBLE;
  const auto use = [&](bool all) {
    auto left = random() % 4;
    lx::test::in_all_forms([&](const auto& form) {
      if (all || left-- == 0) Texts(form, locale, other, random).use();
    });
  };
  use(all_forms);
  change_locale(locale, other, random);
  use(false);
}

}  // namespace mutate
