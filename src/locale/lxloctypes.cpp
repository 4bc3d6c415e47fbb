// The object types language and territory: what is proven when one is loaded, and the payloads of English and
// UnitedStates, in force without a locale directory and laid out at compile time from their texts.
#include "locale/lxlocale.h"

using namespace lx;

namespace {

namespace language = format::language;
namespace territory = format::territory;

/// The words and texts of a payload that is being validated.
class TextPayload {
 public:
  explicit TextPayload(Bytes payload) : payload_(payload) {}

  size_t word(size_t number) const { return le16(payload_.data + 2 * number); }

  /// Whether a null-terminated text at `offset` ends before `end`.
  bool text_ends(size_t offset, size_t end) const {
    for (; offset + 2 <= end; offset += 2)
      if (le16(payload_.data + offset) == 0) return true;
    return false;
  }
  Fault check_texts(size_t first_word, size_t last_word) const {
    for (size_t number = first_word; number <= last_word; ++number)
      if (!text_ends(word(number), payload_.size))
        return corrupt("a text does not end inside the payload", 2 * number);
    return {};
  }
  bool holds_specials(size_t count_word, size_t table_word) const {
    return payload_.holds(word(table_word), word(count_word) * language::SpecialMapping::kBytes);
  }

 private:
  Bytes payload_;
};

Fault validate_language(uint16_t, const Sections& sections) {
  const Bytes bytes = sections.section[0];
  if (!bytes.holds(0, language::kHeaderBytes)) return corrupt("the payload is shorter than its 51 words", 0);
  const TextPayload payload(bytes);
  if (const Fault fault = payload.check_texts(language::kFirstText, language::kLastText)) return fault;
  if (!payload.holds_specials(language::kUpperSpecials, language::kUpperSpecialTable))
    return corrupt("the special mappings to upper case lie outside the payload",
                   2 * language::kUpperSpecialTable);
  if (!payload.holds_specials(language::kLowerSpecials, language::kLowerSpecialTable))
    return corrupt("the special mappings to lower case lie outside the payload",
                   2 * language::kLowerSpecialTable);
  return {};
}

Fault validate_territory(uint16_t, const Sections& sections) {
  // Texts that a locale copies are taken to end where the next one begins; the others only have to end.
  constexpr size_t kCopied[] = {13, 14, 15, 17, 18, 19, 20, 21};
  const Bytes bytes = sections.section[0];
  if (!bytes.holds(0, territory::kHeaderBytes)) return corrupt("the payload is shorter than its 23 words", 0);
  const TextPayload payload(bytes);
  if (const Fault fault = payload.check_texts(territory::kFirstText, territory::kLastText)) return fault;
  if (payload.word(territory::kPayloadBytes) > bytes.size)
    return corrupt("word 22 is larger than the payload", 2 * territory::kPayloadBytes);
  for (size_t number : kCopied)
    if (payload.word(number + 1) > bytes.size ||
        !payload.text_ends(payload.word(number), payload.word(number + 1)))
      return corrupt("a text does not end before the next one begins", 2 * number);
  return {};
}

/// Writes a payload: words by number, texts behind the header.
template <size_t N>
struct Payload {
  uint8_t bytes[N] = {};
  size_t used;

  constexpr explicit Payload(size_t header_bytes) : used(header_bytes) {}

  constexpr void word(size_t number, uint16_t value) { put_le16(bytes + 2 * number, value); }
  constexpr void text(size_t number, const char* ascii) {
    word(number, static_cast<uint16_t>(used));
    do {
      put_le16(bytes + used, static_cast<uint8_t>(*ascii));
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

const ObjectType kLanguageType{validate_language, nullptr, nullptr, &kBuiltInLanguage};
const ObjectType kTerritoryType{validate_territory, nullptr, nullptr, &kBuiltInTerritory};

}  // namespace lx
