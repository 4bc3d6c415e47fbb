// Between tables of mappings and the two directions of the model.
#include "codepage_model.h"

#include <algorithm>
#include <set>

#include "lexicor/hex.h"

namespace lexicor_data {
namespace {

using lexicor_cli::hex_text;

uint32_t utf8_code(uint32_t u) {
  if (u < 0x80) return u;
  if (u < 0x800) return (0xC0 | u >> 6) << 8 | 0x80 | (u & 0x3F);
  return (0xE0 | u >> 12) << 16 | (0x80 | (u >> 6 & 0x3F)) << 8 | 0x80 | (u & 0x3F);
}

}  // namespace

void fill_utf8(CodepageModel& model) {
  model.from_unicode.assign(0x10000, kNoCode);
  for (uint32_t u = 0; u < 0x10000; ++u) {
    model.from_unicode[u] = utf8_code(u);
    if (u != kNoValue) model.to_unicode[utf8_code(u)] = static_cast<uint16_t>(u);
  }
}

uint32_t CodepageModel::round_trip(uint16_t unicode) const {
  const uint32_t code = from_unicode[unicode];
  return code != kNoCode && value_of(code) == unicode ? code : kNoCode;
}

void settle_substitution(CodepageModel& model) {
  for (uint32_t& code : model.from_unicode) {
    if (code == model.substitution()) code = kNoCode;
  }
  const uint16_t substituted = model.value_of(model.substitution());
  if (substituted != kNoValue && model.from_unicode[substituted] == kNoCode) {
    model.from_unicode[substituted] = model.substitution();
  }
}

CodepageModel to_model(const CodepageSource& source, const std::string& file_name,
                       std::vector<LeftOut>& left_out) {
  CodepageModel model;
  model.header = source;
  model.header.source.clear();
  model.header.mappings.clear();
  model.header.bases.clear();
  model.header.warnings.clear();
  model.from_unicode.assign(0x10000, kNoCode);
  if (source.utf8) {
    fill_utf8(model);
    return model;
  }
  auto fail = [&](const Mapping& m, const std::string& what) {
    throw SourceError(file_name, 0, 0,
                      "<U" + hex_text(m.unicode, 4) + "> and code " + hex_text(m.code, 2) + ": " + what);
  };
  std::set<uint32_t> codes_beyond;
  for (const Mapping& m : source.mappings) {
    if (m.unicode > 0xFFFF && m.precision != 1) codes_beyond.insert(m.code);
  }
  for (const Mapping& m : source.mappings) {
    // A value that becomes the code of a character that is left out would be a one-way rest.
    if (m.unicode > 0xFFFF || codes_beyond.count(m.code) != 0) {
      left_out.push_back({m, m.unicode > 0xFFFF ? "beyond U+FFFF" : "to a code beyond U+FFFF"});
      continue;
    }
    if (code_bytes(m.code) != m.bytes) fail(m, "a longer character cannot begin with a zero byte");
    for (int shift = 8; shift < 8 * (m.bytes - 1); shift += 8) {
      if ((m.code >> shift & 0xFF) == 0) fail(m, "a longer character cannot hold a zero byte");
    }
    const auto unicode = static_cast<uint16_t>(m.unicode);
    if (m.precision != 1 && unicode != kNoValue) {
      uint16_t& value = model.to_unicode[m.code];
      if (value != kNoValue && value != unicode) fail(m, "the code has another value too");
      value = unicode;
    }
    if (m.precision != 3) {
      uint32_t& code = model.from_unicode[unicode];
      if (code != kNoCode && code != m.code) fail(m, "the value has another code too");
      code = m.code;
    }
  }
  settle_substitution(model);
  return model;
}

CodepageSource to_source(const CodepageModel& model) {
  CodepageSource source = model.header;
  if (source.utf8) return source;
  auto add = [&](uint32_t unicode, uint32_t code, uint8_t precision) {
    source.mappings.push_back({unicode, code, code_bytes(code), precision});
  };
  for (uint32_t u = 0; u < 0x10000; ++u) {
    const uint32_t code = model.from_unicode[u];
    if (code != kNoCode) add(u, code, model.value_of(code) == u ? 0 : 1);
  }
  for (const auto [code, u] : model.to_unicode) {
    if (model.from_unicode[u] != code) add(u, code, 3);
  }
  std::sort(source.mappings.begin(), source.mappings.end(), in_table_order);
  return source;
}

}  // namespace lexicor_data
