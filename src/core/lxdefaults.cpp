// The built-in language English and territory UnitedStates: the payloads in force without a locale directory,
// laid out at compile time from their texts.
#include "core/lxformat.h"
#include "core/lxobjtypes.h"

namespace {

namespace language = lx::format::language;
namespace territory = lx::format::territory;

/// Writes a payload: words by number, texts behind the header.
template <size_t N>
struct Payload {
  uint8_t bytes[N] = {};
  size_t used;

  constexpr explicit Payload(size_t header_bytes) : used(header_bytes) {}

  constexpr void word(size_t number, uint16_t value) { lx::put_le16(bytes + 2 * number, value); }
  constexpr void text(size_t number, const char* ascii) {
    word(number, static_cast<uint16_t>(used));
    do {
      lx::put_le16(bytes + used, static_cast<uint8_t>(*ascii));
      used += 2;
    } while (*ascii++ != '\0');
  }
};

constexpr size_t kEnglishBytes = 578;
constexpr size_t kUnitedStatesBytes = 192;

constexpr const char* kEnglishTexts[] = {
    "EN",        "English",                                                                        // names
    "Sunday",    "Monday",   "Tuesday",  "Wednesday", "Thursday", "Friday", "Saturday",            // days
    "Sun",       "Mon",      "Tue",      "Wed",       "Thu",      "Fri",    "Sat",                 //
    "January",   "February", "March",    "April",     "May",      "June",   "July",     "August",  // months
    "September", "October",  "November", "December",  "",                                          //
    "Jan",       "Feb",      "Mar",      "Apr",       "May",      "Jun",    "Jul",      "Aug",     //
    "Sep",       "Oct",      "Nov",      "Dec",       "",                                          //
    "AM",        "PM",
};

constexpr Payload<kEnglishBytes> make_english() {
  Payload<kEnglishBytes> p(language::kHeaderBytes);
  p.word(language::kDefaultTerritory, 1);
  p.word(language::kDefaultCodepage, 1);
  p.word(language::kDefaultSort, 0);
  size_t word = language::kFirstText;
  for (const char* text : kEnglishTexts) p.text(word++, text);
  p.word(language::kUpperSpecialTable, static_cast<uint16_t>(p.used));
  p.word(language::kLowerSpecialTable, static_cast<uint16_t>(p.used));
  return p;
}

constexpr const char* kUnitedStatesTexts[] = {
    "USA", "United States", "3;0", "3;0", "$", "USD", "", "-", "%#I:%M:%S %p", "%#m/%#d/%y", "%A, %B %d, %Y",
};

constexpr Payload<kUnitedStatesBytes> make_united_states() {
  Payload<kUnitedStatesBytes> p(territory::kHeaderBytes);
  const char separators[] = {'.', ',', ',', '.', ','};
  size_t word = territory::kSeparators;
  for (char separator : separators) p.word(word++, static_cast<uint8_t>(separator));
  for (word = territory::kNumbers; word < territory::kSignPositions; ++word) p.word(word, 2);
  p.word(territory::kSignPositions, 3);  // low byte: positive 3, high byte: negative 0
  p.word(territory::kFlags, 0x6B);
  word = territory::kFirstText;
  for (const char* text : kUnitedStatesTexts) p.text(word++, text);
  p.word(territory::kPayloadBytes, static_cast<uint16_t>(p.used));
  return p;
}

constexpr Payload<kEnglishBytes> kEnglish = make_english();
constexpr Payload<kUnitedStatesBytes> kUnitedStates = make_united_states();
static_assert(kEnglish.used == kEnglishBytes && kUnitedStates.used == kUnitedStatesBytes,
              "no room is left over");

}  // namespace

namespace lx {

const BuiltIn kBuiltInLanguage{"English", {{{kEnglish.bytes, kEnglishBytes}}}, nullptr};
const BuiltIn kBuiltInTerritory{"UnitedStates", {{{kUnitedStates.bytes, kUnitedStatesBytes}}}, nullptr};

}  // namespace lx
