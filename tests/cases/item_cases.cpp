// The family of items.txt.
#include "cases/case_runner.h"

namespace lx::test {

namespace {

/// Sets an item by number; packed codes, which have no numbers of their own, move to an object by its door.
template <class R>
int32_t set_number(R& r, int32_t number, int32_t value) {
  const bool territory = number == LX_ITEM_TERRITORY_ID;
  if (!std::is_same_v<typename R::Form, Wide> || (!territory && number != LX_ITEM_CODEPAGE_ID))
    return LXSetLocaleNumInfo(r.l, number, value);
  int32_t rc = LX_OK;
  LXObject* const object = LXGetObjFromID(nullptr, territory ? LX_TERRITORY : LX_CODEPAGE,
                                          static_cast<uint16_t>(value), LX_FIND_AND_LOAD, &rc);
  const int32_t code = (territory ? LXLocaleChangeTerritory : LXLocaleChangeCodePage)(r.l, object);
  EXPECT_EQ(LXGetError(r.l), code);
  return code == LX_OK;
}

/// Sets an item, as text and by number; what fails or has no length changes nothing.
template <class R>
int32_t set(R& r, const CaseWords::Word& word) {
  const int32_t number = std::stoi(word.name);
  const std::string before = state_of(r.l);
  int32_t done = 0;
  if (word.quoted) {
    const auto text = r.input(word.name, states.text);
    const int32_t flags = static_cast<int32_t>(r.flags) & ~LX_TERRITORY_VALUES;
    EXPECT_EQ(R::Form::set_item(r.l, number, text.data(), 0, flags), 1);
    EXPECT_EQ(state_of(r.l), before);
    done = R::Form::set_item(r.l, number, text.data(), text.length, flags);
  } else {
    word.used = true;
    done = set_number(r, number, std::stoi(word.value));
  }
  const int32_t code = LXGetError(r.l);
  EXPECT_EQ(done, code == LX_OK);
  if (code != LX_OK) {
    EXPECT_EQ(state_of(r.l), before);
  }
  return code;
}

/// A text in every size, whole characters and closed, and in characters.
template <class R>
void expect_text(R& r, int32_t number, const Units& text) {
  using Unit = typename R::Unit;
  const int32_t flags = static_cast<int32_t>(r.flags) & LX_TERRITORY_VALUES;
  const Units codepage = item(r.l, LX_ITEM_CODEPAGE);
  const TinyCodepage& cp = case_codepage({codepage.begin(), codepage.end()});
  if (cp.shift && std::is_same_v<typename R::Form, Plain>) return;
  std::vector<std::vector<Unit>> prefixes;  // of each number of characters, with nulls
  for (size_t chars = 0; chars <= text.size(); ++chars)
    prefixes.push_back(Encoded<typename R::Form>(cp, text.substr(0, chars), states.output).terminated());
  for (size_t size = 0; size < prefixes.back().size() + 3; ++size) {
    SCOPED_TRACE(size);
    std::vector<Unit> expected;
    if (size > 0) expected.push_back(0);
    for (const auto& prefix : prefixes)
      if (prefix.size() <= size) expected = prefix;
    std::vector<Unit> block(size);
    const int32_t result = R::Form::get_item(r.l, number, block.data(), static_cast<int32_t>(size), flags);
    EXPECT_EQ(result, count_of(expected));
    block.resize(expected.size());
    EXPECT_EQ(testing::PrintToString(block), testing::PrintToString(expected));
  }
  for (size_t chars = 1; R::kBytes && chars <= prefixes.size(); ++chars) {
    auto block = prefixes[chars - 1];
    std::fill(block.begin(), block.end(), R::kCanary);
    EXPECT_EQ(R::Form::get_item(r.l, number, block.data(), static_cast<int32_t>(chars), flags | LX_CHARACTERS),
              static_cast<int32_t>(chars));
    EXPECT_EQ(testing::PrintToString(block), testing::PrintToString(prefixes[chars - 1]));
  }
}

template <class R>
void items(R& r) {
  int32_t code = LX_OK;
  for (const CaseWords::Word& word : r.given().all)
    if (isdigit(word.name[0]) != 0) {
      EXPECT_EQ(code, LX_OK) << "before " << word.name;
      code = set(r, word);
    }
  // What was set stays, and all else is the territory's already.
  if (code == LX_OK) {
    EXPECT_EQ(LXLocaleSetModifiable(r.l), LX_OK);
  }
  for (const CaseWords::Word& word : r.expected().all)
    if (word.quoted && word.name != "says") {
      SCOPED_TRACE(word.name);
      expect_text(r, std::stoi(word.name), r.expected().text(word.name).units());
    } else if (isdigit(word.name[0]) != 0) {
      word.used = true;
      EXPECT_EQ(LXGetLocaleNumInfo(r.l, std::stoi(word.name), 0), std::stoi(word.value)) << word.name;
    }
  r.l->last_error = code;
}

}  // namespace

Families item_families() {
  return {{"items", in_four_forms([](auto& r) { items(r); })}};
}

}  // namespace lx::test
