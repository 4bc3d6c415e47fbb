// Types of characters, and the language's special case mappings. Per-character primitives: no trace.
#include "codepage/lxprimitive.h"
#include "codepage/lxunicode.h"

using namespace lx;

namespace {

namespace fmt = format::codepage;

/// The field of a type word that a selector asks for; any other selector gives the classification.
uint32_t type_field(const Primitive& in, uint32_t word, uint32_t selector) {
  switch (selector) {
    case LX_CTYPE1:
      return fmt::type1_of(word);
    case LX_CTYPE2:
      return fmt::type2_of(word);
    case LX_CTYPE3:
      return fmt::type3_of(word);
    default:
      in.fail(LX_E_INVALID);
      return fmt::type1_of(word);
  }
}

uint32_t type_of(const uint8_t* record) {
  return fmt::TypeRecord::read(record).type;
}

}  // namespace

namespace lx {

const uint8_t* type_record(const Codepage& cp, const uint8_t* p) {
  if (cp.single_byte) return nullptr;
  const uint8_t* nodes = cp.payload + le16(cp.payload + fmt::kTypeTrie);
  fmt::TypeNode node = fmt::TypeNode::read(nodes);
  while (node.leaf == 0) node = fmt::TypeNode::read(nodes + fmt::TypeNode::kBytes * node.next(*p++));
  return cp.payload + le16(cp.payload + fmt::kTypeRecords) + fmt::TypeRecord::kBytes * node.next(*p);
}

const uint8_t* type_record_of_code(const Codepage& cp, uint32_t code) {
  uint8_t bytes[kMaxCharBytes] = {};
  store_packed(bytes, code);
  return type_record(cp, bytes);
}

uint32_t other_case(const uint8_t* record, uint32_t code, uint32_t mask) {
  if (record == nullptr) return code;
  const auto type = fmt::TypeRecord::read(record);
  return (type.type & mask) != 0 ? code + type.case_delta : code;
}

Specials specials_of(const LXObject& language, bool upper) {
  namespace words = format::language;
  const uint8_t* payload = payload_of(language);
  const size_t count = le16(payload + 2 * (upper ? words::kUpperSpecials : words::kLowerSpecials));
  const size_t offset = le16(payload + 2 * (upper ? words::kUpperSpecialTable : words::kLowerSpecialTable));
  return {payload + offset, count};
}

int32_t Specials::find(uint16_t first, uint16_t second, uint16_t* result1, uint16_t* result2) const {
  for (size_t i = 0; i < count; ++i) {
    const format::language::SpecialMapping mapping = entry(i);
    if (mapping.first != first || mapping.second != second) continue;
    *result1 = mapping.result1;
    *result2 = mapping.result2;
    return mapping.result2 == 0 ? 1 : 2;
  }
  return 0;
}

}  // namespace lx

extern "C" {

uint32_t LXGetCharType(LXLocale* locale, const char* text, uint32_t selector) {
  const Primitive in(locale);
  if (!in) return 0;
  const uint8_t* p = bytes_of(text);
  const bool single = in.single_byte() || in.cp().length(*p) == 1;
  return type_field(in, single ? in.cp().type(*p) : type_of(type_record(in.cp(), p)), selector);
}

uint32_t LXGetCharTypeW(LXLocale* locale, LXWChar code, uint32_t selector) {
  const Primitive in(locale);
  if (!in) return 0;
  const bool single = in.single_byte() || code <= 0xFF;
  return type_field(
      in, single ? in.cp().type(static_cast<uint8_t>(code)) : type_of(type_record_of_code(in.cp(), code)),
      selector);
}

uint32_t LXGetCharTypeU(LXLocale* locale, LXUChar unicode, uint32_t selector) {
  const Primitive in(locale);
  return in ? type_field(in, unicode_type(unicode), selector) : 0;
}

uint32_t LXGetCharTypeEx(LXLocale* locale, const char* text, LXShiftState state, uint32_t selector) {
  const Primitive in(locale);
  if (!in) return 0;
  if (in.single_byte() || !in.shift_sensitive()) return LXGetCharType(locale, text, selector);
  const uint8_t* p = bytes_of(text);
  take_shift(in.cp(), &p, &state);
  const bool single = state != LX_SHIFT_DOUBLE;
  return type_field(in, single ? in.cp().type(*p) : type_of(type_record(in.cp(), p)), selector);
}

const uint8_t* LXGetMbCtype(const LXObject* codepage, const char* text) {
  return initialized() ? type_record(codepage_of(*codepage), bytes_of(text)) : nullptr;
}

const uint8_t* LXGetMbCtypeW(const LXObject* codepage, LXWChar code) {
  return initialized() ? type_record_of_code(codepage_of(*codepage), code) : nullptr;
}

int32_t LXLangGetSpecial(const LXObject* language, LXUChar first, LXUChar second, LXUChar* result1,
                         LXUChar* result2, int32_t selector) {
  constexpr int32_t kUpperSelector = 44;
  if (!initialized()) return 0;
  return specials_of(*language, selector == kUpperSelector).find(first, second, result1, result2);
}

}  // extern "C"
