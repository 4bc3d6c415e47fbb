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

constexpr unsigned kBytes = 256;

std::string code_text(uint32_t code) {
  std::string bytes;
  for (int shift = 24; shift >= 0; shift -= 8)
    if (shift == 0 || code >> shift != 0) bytes.push_back(static_cast<char>(code >> shift));
  return bytes;
}

}  // namespace

CodepageBuilder::CodepageBuilder(uint16_t id, std::string name, uint8_t width)
    : id_(id), name_(std::move(name)), width_(width), lengths_(kBytes, 1) {}

CodepageBuilder& CodepageBuilder::lead(uint8_t first, uint8_t last, uint8_t length) {
  for (unsigned b = first; b <= last; ++b) lengths_[b] = length;
  return *this;
}

CodepageBuilder& CodepageBuilder::map(uint32_t code, uint16_t unicode, unsigned count) {
  for (unsigned i = 0; i < count; ++i) {
    to_unicode_[code + i] = static_cast<uint16_t>(unicode + i);
    to_code_[static_cast<uint16_t>(unicode + i)] = code + i;
  }
  return *this;
}

TinyCodepage CodepageBuilder::build() const {
  using lexicor_data::CodepageClass;
  lexicor_data::CodepageModel model;
  lexicor_data::CodepageSource& header = model.header;
  header.name = name_;
  header.kind = shift_       ? CodepageClass::kShiftStateful
                : width_ > 1 ? CodepageClass::kMultiByte
                             : CodepageClass::kSingleByte;
  header.width = width_;
  header.substitution = substitution_;
  header.ascii = !shift_;
  header.utf8 = id_ == fmt::kUtf8Id;
  std::copy(lengths_.begin(), lengths_.end(), header.leads.begin());
  model.to_unicode = to_unicode_;
  model.from_unicode.assign(0x10000, lexicor_data::kNoCode);
  for (const auto& [unicode, code] : to_code_) model.from_unicode[unicode] = code;
  if (header.utf8) fill_utf8(model);
  std::vector<lexicor_data::LeftOut> left_out;
  std::vector<ByteString> sections = pack_codepage(model, name_, left_out).object.sections;
  if (!left_out.empty()) throw std::length_error("a tiny codepage does not fit");
  sections.resize(format::kMaxSections);
  uint8_t* payload = sections[0].data();
  // Tests that map widths add the tables that they want.
  if (width_ > 1) std::fill_n(payload + le16(payload + fmt::kFullWidth), fmt::kFullWidthBytes, uint8_t{0});
  put_le16(payload + fmt::kPairCount, 0);
  payload[fmt::kShiftOut] = shift_out_;
  payload[fmt::kShiftIn] = shift_in_;

  TinyCodepage made{{id_, name_, sections},       width_,        shift_,   static_cast<char>(shift_out_),
                    static_cast<char>(shift_in_), substitution_, lengths_, {}};
  for (const auto& [code, unicode] : to_unicode_)
    if (to_code_.at(unicode) == code) made.characters.push_back({code_text(code), code, unicode});
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
  return CodepageBuilder(9001, "TINY-SINGLE", 1)
      .ascii()
      .map(0xA0, 0xA0, 4)
      .map(0xA5, 0xA5, 91)
      .map(0xA4, 0x20AC)
      .build();
}

TinyCodepage tiny_shift_jis() {
  return CodepageBuilder(9002, "TINY-SJIS", 2)
      .lead(0x81, 0x9F, 2)
      .lead(0xE0, 0xFC, 2)
      .ascii()
      .map(0xA1, 0xFF61, 63)
      .map(0x8140, 0x3000)
      .map(0x8260, 0xFF21, 26)
      .map(0x829F, 0x3041, 83)
      .map(0x8340, 0x30A1, 63)
      .map(0x889F, 0x4E9C)
      .map(0xE0FC, 0x4EF0)
      .build();
}

TinyCodepage tiny_euc() {
  return CodepageBuilder(9003, "TINY-EUC", 3)
      .lead(0x8E, 0x8E, 2)
      .lead(0x8F, 0x8F, 3)
      .lead(0xA1, 0xFE, 2)
      .map(0x00, 0x00, 0x5C)
      .map(0x5C, 0xA5)
      .map(0x5D, 0x5D, 0x23)
      .map(0x8EA1, 0xFF61, 63)
      .map(0xA4A1, 0x3041, 83)
      .map(0xB0A1, 0x4E9C)
      .map(0x8FB0A1, 0x4E02)
      .map(0x8FB0A2, 0x4E04, 2)
      .map(0x8FEDE3, 0x9FA5)
      .build();
}

TinyCodepage tiny_four() {
  return CodepageBuilder(9004, "TINY-FOUR", 4)
      .lead(0x81, 0x84, 2)
      .lead(0x90, 0x91, 4)
      .ascii()
      .map(0x8140, 0x4E02, 63)
      .map(0x84FE, 0x4E90)
      .map(0x90308130, 0x0100, 10)
      .map(0x90318130, 0x010A, 10)
      .map(0x91398139, 0x01FF)
      .build();
}

TinyCodepage tiny_shift() {
  return CodepageBuilder(9005, "TINY-SHIFT", 2)
      .shift(0x0E, 0x0F)
      .substitution(0x6F)
      .map(0x00, 0x00, 4)
      .map(0x25, 0x0A)
      .map(0x40, 0x20)
      .map(0x6F, '?')
      .map(0x81, 'a', 9)
      .map(0x91, 'j', 9)
      .map(0xC1, 'A', 9)
      .map(0xD1, 'J', 9)
      .map(0xF0, '0', 10)
      .map(0x4040, 0x3000)
      .map(0x42C1, 0xFF21, 9)
      .map(0x4447, 0x3041, 83)
      .map(0x4541, 0x4E9C, 3)
      .build();
}

TinyCodepage tiny_utf8() {
  CodepageBuilder builder(fmt::kUtf8Id, "TINY-UTF8", 3);
  builder.ascii().lead(0xC0, 0xDF, 2).lead(0xE0, 0xFF, 3);
  // The mappings serve the type trie and the tests; conversion does not look at them.
  builder.map(0xC3A0, 0xE0, 0x20).map(0xC480, 0x100, 0x40).map(0xE38181, 0x3041, 63);
  builder.map(0xE4BA80, 0x4E80, 64);
  return builder.build();
}

std::vector<TinyCodepage> tiny_codepages() {
  return {tiny_single(),
          tiny_shift_jis(),
          tiny_euc(),
          tiny_four(),
          tiny_shift(),
          tiny_utf8(),
          CodepageBuilder(fmt::kCommonId, "US-ASCII", 1).ascii().build()};
}

TinyLibrary::TinyLibrary(const std::vector<TinyCodepage>& codepages) {
  std::vector<ScratchDirectory::Codepage> files;
  for (const TinyCodepage& codepage : codepages) files.push_back(codepage.file);
  // The control file lists identifiers in ascending order.
  std::sort(files.begin(), files.end(), [](const auto& a, const auto& b) { return a.id < b.id; });
  directory_.write_locale(files);
  if (LXInit(directory_.path().c_str(), Hooks::allocate, Hooks::release, &hooks_, LX_NO_DEFAULTS) != LX_OK)
    throw std::runtime_error("LXInit failed");
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

LXLocale* TinyLibrary::locale(const TinyCodepage& codepage) {
  LXLocale*& kept = locales_[codepage.file.name];
  int32_t rc = LX_OK;
  if (kept == nullptr) kept = LXGetLocale(("English_UnitedStates." + codepage.file.name).c_str(), 0, &rc);
  if (kept == nullptr) {
    locales_.erase(codepage.file.name);
    throw std::runtime_error("no locale of " + codepage.file.name + ": " + std::to_string(rc));
  }
  return kept;
}

const LXObject* TinyLibrary::object(uint16_t id, int32_t* rc) {
  return LXGetObjFromID(nullptr, LX_CODEPAGE, id, LX_FIND_AND_LOAD, rc);
}

const LXObject* TinyLibrary::object(const TinyCodepage& codepage) {
  int32_t rc = LX_OK;
  const LXObject* found = object(codepage.file.id, &rc);
  if (found == nullptr)
    throw std::runtime_error("no object of " + codepage.file.name + ": " + std::to_string(rc));
  return found;
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
  code_ = kCodepageType.validate(id, exact).code;
  if (code_ != LX_OK) return;
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
