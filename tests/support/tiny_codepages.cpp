#include "support/tiny_codepages.h"

#include <algorithm>
#include <stdexcept>
#include <utility>

#include "codepage/lxcodepage.h"
#include "codepage_pack.h"
#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "core/lxmemory.h"

namespace lx::test {
namespace {

namespace fmt = format::codepage;

using lexicor_data::CodepageClass;

std::string code_text(uint32_t code) {
  char bytes[kMaxCharBytes];
  const size_t count = code_bytes(code);
  store_code(bytes_of(bytes), code, count);
  return std::string(bytes, count);
}

}  // namespace

CodepageBuilder::CodepageBuilder(uint16_t id, std::string name, uint8_t width) : id_(id) {
  model_.header.name = std::move(name);
  model_.header.kind = width > 1 ? CodepageClass::kMultiByte : CodepageClass::kSingleByte;
  model_.header.width = width;
  model_.header.utf8 = id == fmt::kUtf8Id;
  model_.from_unicode.assign(0x10000, lexicor_data::kNoCode);
}

TinyCodepage CodepageBuilder::build() const {
  const lexicor_data::CodepageSource& header = model_.header;
  lexicor_data::CodepageModel model = model_;
  if (header.utf8) fill_utf8(model);
  std::vector<lexicor_data::LeftOut> left_out;
  std::vector<ByteString> sections = pack_codepage(model, header.name, left_out).object.sections;
  if (!left_out.empty()) throw std::length_error("a tiny codepage does not fit");
  sections.resize(format::kMaxSections);
  uint8_t* payload = sections[0].data();
  payload[fmt::kShiftOut] = shift_out_;
  payload[fmt::kShiftIn] = shift_in_;

  const char out = static_cast<char>(shift_out_), in = static_cast<char>(shift_in_);
  TinyCodepage made{
      {id_, header.name, sections}, header.width, model.is_shift(), out, in, header.substitution, {}};
  for (const auto [code, unicode] : model_.to_unicode)
    if (model_.from_unicode[unicode] == code) made.characters.push_back({code_text(code), code, unicode});
  return made;
}

const TinyCharacter* TinyCodepage::find(uint16_t unicode) const {
  for (const TinyCharacter& c : characters)
    if (c.unicode == unicode) return &c;
  return nullptr;
}

std::string TinyCodepage::encode(const std::vector<uint16_t>& text, LXShiftState* state) const {
  std::string bytes;
  LXShiftState own = LX_SHIFT_SINGLE;
  LXShiftState& now = state != nullptr ? *state : own;
  for (uint16_t u : text) {
    const TinyCharacter* c = find(u);
    std::string one = c != nullptr ? c->bytes : std::string(1, static_cast<char>(substitution));
    if (file.id == fmt::kUtf8Id) {
      one.resize(utf8_bytes(u));
      store_utf8(bytes_of(one.data()), u, one.size());
    }
    const LXShiftState needed = one.size() > 1 ? LX_SHIFT_DOUBLE : LX_SHIFT_SINGLE;
    if (shift && needed != now) bytes.push_back(needed == LX_SHIFT_DOUBLE ? shift_out : shift_in);
    if (shift) now = needed;
    bytes += one;
  }
  return bytes;
}

TinyCodepage tiny_single() {
  CodepageBuilder builder(9001, "TINY-SINGLE", 1);
  return builder.ascii().map(0xA0, 0xA0, 4).map(0xA5, 0xA5, 91).map(0xA4, 0x20AC).build();
}

TinyCodepage shift_jis(uint16_t id, const char* name) {
  CodepageBuilder builder(id, name, 2);
  builder.ascii().lead(0x81, 0x9F, 2).lead(0xE0, 0xFC, 2).map(0xA1, 0xFF61, 63).map(0x8140, 0x3000);
  builder.map(0x824F, 0xFF10, 10).map(0x8260, 0xFF21, 26).map(0x8281, 0xFF41, 26).map(0x829F, 0x3041, 83);
  builder.map(0x8340, 0x30A1, 63).map(0x8440, 0xFFE8, 7).map(0x84A0, 0x2502).map(0x889F, 0x4E9C);
  return builder.map(0x898E, 0x5186).map(0xE0FC, 0x4EF0).build();
}
TinyCodepage tiny_shift_jis() {
  return shift_jis(9002, "TINY-SJIS");
}

TinyCodepage tiny_euc() {
  CodepageBuilder builder(9003, "TINY-EUC", 3);
  builder.lead(0x8E, 0x8E, 2).lead(0x8F, 0x8F, 3).lead(0xA1, 0xFE, 2);
  builder.map(0x00, 0x00, 0x5C).map(0x5C, 0xA5).map(0x5D, 0x5D, 0x23).map(0x8EA1, 0xFF61, 63);
  builder.map(0xA4A1, 0x3041, 83).map(0xB0A1, 0x4E9C).map(0x8FB0A1, 0x4E02).map(0x8FB0A2, 0x4E04, 2);
  return builder.map(0x8FEDE3, 0x9FA5).build();
}

TinyCodepage tiny_four() {
  CodepageBuilder builder(9004, "TINY-FOUR", 4);
  builder.ascii().lead(0x81, 0x84, 2).lead(0x90, 0x91, 4);
  builder.map(0x8140, 0x4E02, 63).map(0x84FE, 0x4E90).map(0x90308130, 0x0100, 10).map(0x90318130, 0x010A, 10);
  return builder.map(0x91398139, 0x01FF).build();
}

TinyCodepage ebcdic(uint16_t id, const char* name, bool katakana) {
  CodepageBuilder builder(id, name, 2);
  builder.shift(0x0E, 0x0F).substitution(0x6F).map(0x00, 0x00, 4).text(0x25, "\n").text(0x40, " ");
  builder.text(0x4B, ".").text(0x4D, "(+").text(0x5A, "!$").text(0x5D, ");").text(0x60, "-/").text(0x6B, ",%_");
  builder.text(0x6F, "?").text(0x7A, ":#").text(0x7D, "'");
  builder.text(0xC1, "ABCDEFGHI").text(0xD1, "JKLMNOPQR").text(0xE2, "STUVWXYZ").text(0xF0, "0123456789");
  if (katakana)
    builder.text(0x62, "abcdefgh").text(0x71, "ijklmnop").text(0x8B, "q").text(0x9B, "r").text(0xAB, "s");
  else
    builder.text(0x81, "abcdefghi").text(0x91, "jklmnopqr").text(0xA2, "stuvwxyz");
  if (katakana) builder.text(0xB3, "tuvwxyz");
  builder.map(0x4040, 0x3000).map(0x4281, 0xFF41, 9).map(0x42C1, 0xFF21, 9).map(0x42F0, 0xFF10, 10);
  return builder.map(0x4447, 0x3041, 83).map(0x4541, 0x4E9C, 3).map(0x4551, 0x5186).build();
}
TinyCodepage tiny_shift() {
  return ebcdic(9005, "TINY-SHIFT", false);
}

TinyCodepage tiny_utf8() {
  CodepageBuilder builder(fmt::kUtf8Id, "TINY-UTF8", 3);
  builder.ascii().lead(0xC2, 0xDF, 2).lead(0xE0, 0xEF, 3);
  // The mappings serve the type trie and the tests; conversion does not look at them.
  builder.map(0xC2A0, 0xA0, 32).map(0xC380, 0xC0, 64).map(0xC480, 0x100, 64).map(0xCC80, 0x300, 16);
  builder.map(0xD9A0, 0x660, 10).map(0xE28080, 0x2000).map(0xE28090, 0x2010, 2).map(0xE282AC, 0x20AC);
  builder.map(0xE29883, 0x2603).map(0xE38080, 0x3000, 4).map(0xE38181, 0x3041, 63).map(0xE4B880, 0x4E00, 64);
  builder.map(0xE4BA80, 0x4E80, 64).map(0xE4BC80, 0x4F00).map(0xE58686, 0x5186).map(0xEFBC90, 0xFF10, 10);
  return builder.map(0xEFBCA1, 0xFF21, 26).map(0xEFBD81, 0xFF41, 26).map(0xEFBDA1, 0xFF61, 31).build();
}

std::vector<TinyCodepage> tiny_codepages() {
  const TinyCodepage common = CodepageBuilder(fmt::kCommonId, "US-ASCII", 1).ascii().build();
  return {tiny_single(), tiny_shift_jis(), tiny_euc(), tiny_four(), tiny_shift(), tiny_utf8(), common};
}

TinyLibrary::TinyLibrary(const std::vector<TinyCodepage>& codepages,
                         const std::vector<ScratchDirectory::Object>& others) {
  std::vector<ScratchDirectory::Codepage> files;
  for (const TinyCodepage& codepage : codepages) files.push_back(codepage.file);
  directory_.write_locale(files, others);
  if (LXInit(directory_.path().c_str(), Hooks::allocate, Hooks::release, &hooks_, LX_NO_DEFAULTS) != LX_OK) {
    LXTerm();  // a warning leaves it initialised
    throw std::runtime_error("LXInit failed");
  }
  open_ = true;
}

bool TinyLibrary::close() {
  if (!open_) return true;
  open_ = false;
  bool good = true;
  for (const auto& [name, locale] : locales_) good &= LXReleaseLocale(locale) == LX_OK;
  good &= LXTerm() == LX_OK;
  return good && hooks_.live_blocks() == 0 && hooks_.wrong_frees() == 0;
}

LXLocale* TinyLibrary::new_locale(const TinyCodepage& codepage, const std::string& language,
                                  const std::string& sort) {
  const std::string name = language + "_UnitedStates." + codepage.file.name + (sort.empty() ? "" : "@" + sort);
  int32_t rc = LX_OK;
  LXLocale* const made = LXGetLocale(name.c_str(), 0, &rc);
  if (made == nullptr) throw std::runtime_error("no locale " + name + ": " + std::to_string(rc));
  return made;
}

LXLocale* TinyLibrary::locale(const TinyCodepage& codepage, const std::string& language,
                              const std::string& sort) {
  const std::string key = language + "." + codepage.file.name + "@" + sort;
  const auto found = locales_.find(key);
  if (found != locales_.end()) return found->second;
  LXLocale* const made = new_locale(codepage, language, sort);
  return locales_[key] = made;
}

CodepageObject::CodepageObject(uint16_t id, const std::vector<ByteString>& sections) : sections_(sections) {
  sections_.resize(format::kMaxSections);
  Sections exact;
  for (size_t i = 0; i < sections_.size(); ++i) {
    sections_[i].shrink_to_fit();
    exact.section[i] = {sections_[i].data(), sections_[i].size()};
    object_.section[i] = sections_[i].data();
  }
  object_.disk.id = id;
  object_.disk.type = LX_CODEPAGE;
  locale_.codepage = &object_;
  fault_ = kCodepageType.validate(id, exact);
  if (fault_) return;
  object_.derived = derive_codepage(id, exact);
  if (object_.derived == nullptr) throw std::runtime_error("no memory for a codepage");
  const lx::Codepage& cp = codepage_of(object_);
  locale_.flags =
      static_cast<uint16_t>((cp.single_byte ? kLocaleSingleByte : 0) | (cp.shift_sensitive ? kLocaleShift : 0));
}

CodepageObject::~CodepageObject() {
  hook_free(object_.derived);
}

}  // namespace lx::test
