// Looks codepages up by name, identifier and alias, and opens a locale on the one that is found.
#include "codepage.h"

#include <algorithm>
#include <cctype>
#include <cstdlib>
#include <iterator>
#include <limits>

#include "catalogue.h"
#include "near_names.h"

namespace lexicor_cli {

namespace {

bool is_decimal(const std::string& text) {
  if (text.empty() || text.size() > 9) return false;
  for (const char c : text) {
    if (std::isdigit(static_cast<unsigned char>(c)) == 0) return false;
  }
  return true;
}

/// The object name of a codepage, or an empty string. A name stands before an identifier, and that before an
/// alias.
std::string find_codepage(const std::string& text) {
  int32_t code = LX_OK;
  const auto bytes = static_cast<int32_t>(text.size());
  const LXObject* object = LXGetObjFromName(nullptr, LX_CODEPAGE, text.c_str(), bytes, LX_FIND_ONLY, &code);
  if (object == nullptr && is_decimal(text)) {
    const unsigned long id = std::strtoul(text.c_str(), nullptr, 10);
    if (id <= std::numeric_limits<uint16_t>::max())
      object = LXGetObjFromID(nullptr, LX_CODEPAGE, static_cast<uint16_t>(id), LX_FIND_ONLY, &code);
  }
  const auto* const found = reinterpret_cast<const LXObjDisk*>(object);
  if (found != nullptr && found->type == LX_CODEPAGE) return found->name;
  const char* name = LXGetCodepageFromAlias(nullptr, text.c_str());
  return name != nullptr ? name : "";
}

/// Whether a name is one of UTF-16 and UTF-32, in any byte order: "utf16", "UCS-2LE", "1200".
bool is_wide_encoding(const std::string& text) {
  std::string name;
  for (const char c : text) {
    if (std::isalnum(static_cast<unsigned char>(c)) != 0) name += lower_ascii(c);
  }
  const std::string end = name.size() > 2 ? name.substr(name.size() - 2) : "";
  if (end == "le" || end == "be") name.resize(name.size() - 2);
  constexpr const char* kNames[] = {"utf16", "utf32", "ucs2",  "ucs4", "iso10646",
                                    "1200",  "1201",  "12000", "12001"};
  return std::find(std::begin(kNames), std::end(kNames), name) != std::end(kNames);
}

[[noreturn]] void throw_unknown(const Session& session, const std::string& text) {
  if (session.built_in_only())
    throw Failure(kDataError, "codepage '" + text + "' is not there without a locale directory");
  if (is_wide_encoding(text))
    throw Failure(
        kUsageError,
        "codepage '" + text +
            "' is not supported: its characters are no bytes but units of 16 or 32 bits; "
            "'lexicor convert' takes UTF-16 and UTF-32, 'lexicor translate' UTF-16 in this machine's byte "
            "order");
  const std::string near = did_you_mean(nearest_codepages(read_catalogue(), text, 3));
  throw Failure(kUsageError, "unknown codepage '" + text + "'" +
                                 (near.empty() ? "; 'lexicor list codepages' shows those there are" : near));
}

}  // namespace

Codepage::Codepage(const Session& session, const std::string& name, const std::string& language_territory)
    : name_(find_codepage(name)) {
  if (name_.empty()) throw_unknown(session, name);
  int32_t code = LX_OK;
  const auto bytes = static_cast<int32_t>(name_.size());
  object_ = LXGetObjFromName(nullptr, LX_CODEPAGE, name_.c_str(), bytes, LX_FIND_AND_LOAD, &code);
  // With an error code the object holds US-ASCII in place of its own data.
  if (object_ == nullptr || code != LX_OK)
    throw Failure(kDataError, load_problem(LX_CODEPAGE, "codepage", name_, code));
  id_ = reinterpret_cast<const LXObjDisk*>(object_)->id;
  const std::string locale_name =
      (!language_territory.empty() ? language_territory
                                   : first_name(LX_LANGUAGE) + "_" + first_name(LX_TERRITORY)) +
      "." + name_ + "@BINARY";
  locale_ = LXGetLocale(locale_name.c_str(), 0, &code);
  if (locale_ == nullptr) throw Failure(kDataError, "no locale " + locale_name + ": " + describe_code(code));
  learn_shift_bytes();
}

Codepage::~Codepage() {
  LXReleaseLocale(locale_);
}

void Codepage::learn_shift_bytes() {
  // A character stored in the other state gets a shift byte before it, in shift-sensitive codepages only.
  char out[8] = {}, in[8] = {};
  LXPutCharEx(locale_, out, LX_SHIFT_SINGLE, 0x4141);
  LXPutCharEx(locale_, in, LX_SHIFT_DOUBLE, 0x41);
  shift_sensitive_ = in[1] != 0;
  if (!shift_sensitive_) return learn_char_bytes();
  shift_out_ = out[0];
  shift_in_ = in[0];
  double_bytes_ = LXByteLengthEx(locale_, "\x41", LX_SHIFT_DOUBLE);
}

void Codepage::learn_char_bytes() {
  single_byte_ = true;
  for (unsigned byte = 0; byte < char_bytes_.size(); ++byte) {
    const char text = static_cast<char>(byte);
    char_bytes_[byte] = static_cast<uint8_t>(LXByteLength(locale_, &text));
    single_byte_ &= char_bytes_[byte] == 1;
  }
}

size_t Codepage::call_bytes(const char* text, size_t bytes) const {
  if (!shift_sensitive_) return bytes;
  for (size_t i = 1; i < bytes; ++i) {
    if (is_shift(text[i - 1]) && is_shift(text[i])) return i;
  }
  return bytes;
}

size_t Codepage::whole_bytes(const char* text, size_t bytes, LXShiftState state,
                             LXShiftState* end_state) const {
  *end_state = state;  // which no bytes leave as it is
  const char* const end =
      LXMoveStringPointerEx(locale_, text, state, static_cast<int32_t>(bytes), end_state, 0);
  return static_cast<size_t>(end - text);
}

}  // namespace lexicor_cli
