// The families of number.txt and time.txt.
#include <cmath>

#include "cases/case_runner.h"

namespace lx::test {

namespace {

/// What smaller buffers hold, from a state on: whole characters that leave the single-byte state, as many as fit, and
/// code 40 unless they are all. By characters, bytes are made in six for each, and then cut.
template <class R, class Put>
void expect_smaller(R& r, const Units& text, int32_t all, LXShiftState state, Put put) {
  for (const uint32_t flags : {0u, uint32_t{LX_TERMINATE}, uint32_t{LX_TERMINATE | LX_CHARACTERS}})
    for (int32_t size = 1; size <= all; ++size) {
      SCOPED_TRACE("size " + std::to_string(size) + " flags " + std::to_string(flags));
      states.output = states.text = state;
      const auto made = written(r.form, r.l, size, r.flags | flags,
                                [&](auto* to, int32_t room) { return put(to, room, r.flags | flags); });
      states.output = 0;
      const bool chars = (flags & LX_CHARACTERS) != 0;
      const size_t room = static_cast<size_t>(size) - (flags != 0 ? 1 : 0), most = R::kBytes ? 3 : 0;
      const Units part = text.substr(0, chars || !R::kBytes ? room : made.text.size());
      EXPECT_TRUE(made.text == part || (chars && R::kBytes && 6 * size < all + 4)) << shown(made.text);
      EXPECT_TRUE(made.code == LX_E_SIZE || (made.code == LX_OK && (chars || part == text)));
      EXPECT_EQ(made.result, (chars ? count_of(made.text) : count_of(made.units)) + (flags != 0 ? 1 : 0));
      EXPECT_TRUE(chars || made.text == text || made.units.size() + most >= room);
      if (made.units.empty()) continue;
      EXPECT_EQ(decode(r.form, r.l, made.units + encode(r.form, r.l, units("1"))), made.text + units("1"));
    }
  states.text = 0;
}

/// What was written at a size, with and without a null: the expected text in the form, the result and the code. Where
/// the case gives no size, at every smaller one too.
template <class R, class Put>
void expect_written(R& r, Put put) {
  const int32_t given = r.given().number("size", -1000), size = given != -1000 ? given : 120;
  const bool any = r.expected().has("any");
  static const CaseText nothing;
  const CaseText& text = any ? nothing : r.expected().text();
  const auto whole = r.units(text, states.output);
  const int32_t returns = r.expected().number("returns", 0);
  for (const uint32_t null : {0u, uint32_t{LX_TERMINATE}}) {
    if (null != 0 && (size <= 0 || r.once)) continue;
    int32_t result = 0;
    const auto out = r.output(size + (null != 0 ? 1 : 0), &result,
                              [&](auto* to, int32_t room) { return put(to, room, r.flags | null); });
    auto expected = whole;
    if (null != 0) expected.push_back(0);
    EXPECT_EQ(LXGetError(r.l), r.error);
    if (any) continue;
    EXPECT_EQ(testing::PrintToString(out), testing::PrintToString(expected));
    const int32_t count = (r.flags & LX_CHARACTERS) != 0 ? count_of(text.values) : count_of(whole);
    EXPECT_EQ(result, returns != 0 ? returns : count + (null != 0));
  }
  if (size == given || r.null || any || text.raw() || r.error != LX_OK || states.output != 0) return;
  const bool shifts = r.cp.shift && std::is_same_v<typename R::Form, Ex>;
  for (const LXShiftState state : {0u, shifts ? 1u : 0u})
    expect_smaller(r, text.units(), count_of(whole), state, put);
  put(std::vector<typename R::Unit>(120).data(), 120, r.flags);  // stores the code of the case
}

Value::Kind kind_of(const std::string& word) {
  static const std::map<std::string, Value::Kind> kKinds{
      {"long", Value::kLong}, {"double", Value::kDouble}, {"amount", Value::kAmount}};
  return kKinds.at(word);
}

/// "|" in the text stands where reading ends.
template <class R>
void read_number(R& r) {
  using Form = typename R::Form;
  const Value::Kind kind = kind_of(r.given().word());
  const int32_t base = r.given().number("base", 10);
  Units text = r.given().text().units();
  const size_t end = text.find('|');
  if (end == Units::npos) throw CaseError("no end in the text");
  text.erase(end, 1);
  const Encoded<Form> whole(r.cp, text);
  const auto block = r.null ? whole.terminated() : whole.cut(whole.units.size());
  const typename R::Unit* stopped = nullptr;
  const int32_t length = r.null ? -1 : whole.size();
  const double got = kind == Value::kLong ? Form::read_long(r.l, block.data(), length, &stopped, base, r.flags)
                                          : Form::read_double(r.l, block.data(), length, &stopped, r.flags);
  const double expected = std::strtod(r.expected().word().c_str(), nullptr);
  if (std::isnan(expected))
    EXPECT_TRUE(std::isnan(got)) << got;
  else
    EXPECT_EQ(got, expected);
  EXPECT_TRUE(std::isnan(expected) || std::signbit(got) == std::signbit(expected)) << got;
  if (r.expected().has("refused")) return;
  EXPECT_EQ(stopped - block.data(),
            static_cast<ptrdiff_t>(whole.behind(end, whole.units.size(), whole.units.size())));
}

constexpr std::pair<const char*, int32_t LXTime::*> kFields[] = {
    {"seconds", &LXTime::seconds}, {"minutes", &LXTime::minutes},
    {"hours", &LXTime::hours},     {"day", &LXTime::day},
    {"month", &LXTime::month},     {"year", &LXTime::year},
    {"weekday", &LXTime::weekday}, {"day-of-year", &LXTime::day_of_year}};
LXTime time_of(const CaseWords& words, LXTime time) {
  for (const auto& [name, field] : kFields) time.*field = words.number(name, time.*field);
  return time;
}

template <class R>
std::vector<typename R::Unit> terminated(const R& r, const char* ascii) {
  return Encoded<typename R::Form>(r.cp, units(ascii)).terminated();
}

}  // namespace

Families format_families() {
  return {
      {"write", in_four_forms([](auto& r) {
         const Value::Kind kind = kind_of(r.given().word());
         const Value value{kind, std::strtod(r.given().word().c_str(), nullptr)};
         expect_written(r, [&](auto* to, int32_t size, uint32_t flags) {
           return write(r.form, r.l, value, to, size, flags);
         });
       })},
      {"read", in_four_forms([](auto& r) { read_number(r); })},
      {"grouping-size", in_four_forms([](auto& r) {
         const auto text = r.input();
         int32_t remaining = std::stoi(r.given().word());
         const auto* next = text.data() + 77;
         r.number(r.form.grouping_size(r.l, text.data(), &remaining, &next));
         r.number(remaining);
         const std::string word = r.expected().word();
         EXPECT_EQ(next, word == "none" ? nullptr : text.data() + (word == "untouched" ? 77 : std::stoi(word)));
       })},
      // The class of what a text begins with, where "," or "." separates and "pos" and "-" are signs, and the place
      // behind it.
      {"digit", in_four_forms([](auto& r) {
         const auto text = r.input("", states.text);
         const auto* end = text.data();
         r.number(r.form.digit(r.l, text.data(), text.length, &end, terminated(r, ",x").data(),
                               terminated(r, ".").data(), terminated(r, "pos").data(),
                               terminated(r, "-").data(), r.given().number("ascii", r.cp.shift ? 0 : 1),
                               r.flags));
         r.place(end, text);
       })},
      // 4 July 2003, 14:05:09, a Friday.
      {"write-time", in_four_forms([](auto& r) {
         const LXTime time = time_of(r.given(), {9, 5, 14, 4, 6, 103, 5, 184});
         const auto format = r.input("", states.second);
         expect_written(r, [&](auto* to, int32_t size, uint32_t flags) {
           // These count the characters of the format too.
           const bool by_chars = (flags & ~r.flags & LX_CHARACTERS) != 0;
           const int32_t length = by_chars ? count_of(format.start) : format.length;
           return r.form.write_time(r.l, &time, to, size, format.data(), length, flags);
         });
       })},
      {"read-time", in_four_forms([](auto& r) {
         constexpr LXTime kUntouched{-1, -2, -3, -4, -5, -6, -7, -8};
         const auto text = r.input("", states.text), format = r.input("", states.second, "format-length");
         LXTime got = kUntouched;
         r.number(r.form.read_time(r.l, &got, text.data(), text.length, format.data(), format.length, r.flags));
         const LXTime expected = time_of(r.expected(), kUntouched);
         for (const auto& [name, field] : kFields) EXPECT_EQ(got.*field, expected.*field) << name;
       })}};
}

}  // namespace lx::test
