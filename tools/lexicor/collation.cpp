// The locale of the codepage gets the sort of the locale that was named, so that one handle has both.
#include "collation.h"

#include <limits>

namespace lexicor_cli {

namespace {

// Folding makes two characters of a byte, and each of them has two elements of 4 bytes.
constexpr size_t kKeyBytesPerByte = 16;
constexpr size_t kKeySeparators = 3;

int32_t length_of(std::string_view text) {
  if (text.size() > Collation::kMostText)
    throw Failure(kDataError, "a text of " + std::to_string(text.size()) + " bytes is too long to be ordered");
  return static_cast<int32_t>(text.size());
}

[[noreturn]] void throw_failed(LXLocale* locale) {
  throw Failure(kDataError, "the comparison failed: " + describe_code(LXGetError(locale)));
}

}  // namespace

const size_t Collation::kMostText = std::numeric_limits<int32_t>::max() / kKeyBytesPerByte - kKeySeparators;

Collation::Collation(RulesSession& session, const std::string& locale_name, const std::string& codepage)
    : Collation(session, open_chosen_locale(locale_name), codepage, session.sort_id()) {
  session.discard_directory();
}

Collation::Collation(const Session& session, const LocalePtr& named, const std::string& codepage,
                     std::optional<uint16_t> sort_id)
    : codepage_(session, codepage, language_territory(named.get())) {
  const int32_t id = sort_id ? *sort_id : number_item(named.get(), LX_ITEM_SORT_ID).value_or(0);
  int32_t code = LX_OK;
  sort_ = LXGetObjFromID(nullptr, LX_SORT, static_cast<uint16_t>(id), LX_FIND_AND_LOAD, &code);
  if (code == LX_OK && LXSetLocaleNumInfo(codepage_.locale(), LX_ITEM_SORT_ID, id) == 0)
    code = LXGetError(codepage_.locale());
  if (code != LX_OK)
    throw Failure(kDataError, "sort " + std::to_string(id) + " cannot be used: " + describe_code(code));
}

int32_t Collation::compare(std::string_view text1, std::string_view text2, uint32_t options) {
  if (by_key(options)) return key_of(text1, options, sides_[0]).compare(key_of(text2, options, sides_[1]));
  LXLocale* const locale = codepage_.locale();
  const int32_t result = LXStrcollEx(locale, text1.data(), LX_SHIFT_SINGLE, length_of(text1), text2.data(),
                                     LX_SHIFT_SINGLE, length_of(text2), options);
  if (result == 0 && LXGetError(locale) != LX_OK) throw_failed(locale);
  return result;
}

const std::string& Collation::key_of(std::string_view text, uint32_t options, Side& side) {
  if (side.options == options && side.text == text) return side.key;
  side.key.clear();
  append_key(text, options, &side.key);
  side.text = text;
  side.options = options;
  return side.key;
}

void Collation::append_key(std::string_view text, uint32_t options, std::string* keys) const {
  const size_t before = keys->size();
  keys->resize(before + key_room(text));
  keys->resize(before + write_key(text, options, keys->data() + before));
}

size_t Collation::key_room(std::string_view text) {
  return text.size() * kKeyBytesPerByte + kKeySeparators;
}

size_t Collation::write_key(std::string_view text, uint32_t options, char* room) const {
  if (binary() && text.empty()) return 0;
  if (text.empty()) text = "";
  const int32_t length = length_of(text);
  const int32_t bytes =
      LXStrxfrmEx(codepage_.locale(), reinterpret_cast<uint8_t*>(room), static_cast<int32_t>(key_room(text)),
                  text.data(), LX_SHIFT_SINGLE, length, options);
  if (bytes < 0) throw_failed(codepage_.locale());
  return static_cast<size_t>(bytes);
}

void Collation::check_argument(const std::string& text) const {
  LXShiftState state;
  const size_t whole = codepage_.whole_bytes(text.data(), text.size(), LX_SHIFT_SINGLE, &state);
  if (whole == text.size()) return;
  throw Failure(kDataError,
                "'" + text + "' ends inside the character that begins at byte " + std::to_string(whole));
}

}  // namespace lexicor_cli
