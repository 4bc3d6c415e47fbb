// Values are written and read back page by page, when a text has the first one of a page; texts are then looked up in a
// table.
#include "repertoire.h"

#include <sys/mman.h>

#include <cstdint>
#include <cstring>
#include <new>

#include "hex.h"

namespace lexicor_cli {

namespace {

constexpr bool is_surrogate(uint32_t unicode) {
  return unicode >= 0xD800 && unicode <= 0xDFFF;
}

uint8_t* mapped_zeros(size_t bytes) {
  void* const zeros = mmap(nullptr, bytes, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
  if (zeros == MAP_FAILED) throw std::bad_alloc();
  return static_cast<uint8_t*>(zeros);
}

}  // namespace

void Repertoire::Unmapper::operator()(uint8_t* values) const {
  munmap(values, kValues);
}

Repertoire::Repertoire(const Codepage& codepage)
    : codepage_(codepage),
      substitution_(codepage),
      single_(single_byte_values(codepage)),
      clear_(mapped_zeros(kValues)) {}

bool Repertoire::is_lost(LXUChar unicode) const {
  if (codepage_.utf8()) return is_surrogate(unicode);
  const LXWChar code = LXCpUnicodeToCharW(codepage_.object(), unicode);
  return substitution_.stands_for(unicode, code) || value_of(code) != unicode;
}

void Repertoire::learn_page(uint32_t page) const {
  if (!learned_[page]) learn_values(page);
}

void Repertoire::learn_values(uint32_t page) const {
  learned_.set(page);
  for (uint32_t unicode = page * kPage; unicode < (page + 1) * kPage; ++unicode) {
    lost_[unicode] = is_lost(static_cast<LXUChar>(unicode));
    clear_[unicode] = !lost_[unicode] && !asked_[unicode];
  }
}

void Repertoire::watch(LXUChar unicode) {
  asked_.set(unicode);
  clear_[unicode] = 0;
}

bool Repertoire::has_all(const LXUChar* units, size_t count) const {
  constexpr size_t kTogether = 16;
  const auto all_clear = [&](const LXUChar* some, size_t some_count) {
    uint8_t clear = 1;
    for (size_t i = 0; i < some_count; ++i) clear &= clear_[some[i]];
    return clear != 0;
  };
  const auto lacks = [&](const LXUChar* some, size_t some_count) {
    if (all_clear(some, some_count)) return false;
    for (size_t i = 0; i < some_count; ++i) learn_page(some[i] / kPage);
    return !all_clear(some, some_count);
  };
  const auto is_ascii = [](const LXUChar* some) {
    unsigned all_bits = 0;
    for (size_t i = 0; i < kTogether; ++i) all_bits |= some[i];
    return all_bits < kAscii;
  };
  learn_page(0);
  const bool ascii_is_clear = std::memchr(clear_.get(), 0, kAscii) == nullptr;
  size_t i = 0;
  for (; count - i >= kTogether; i += kTogether) {
    if (ascii_is_clear && units[i] < kAscii && is_ascii(units + i)) continue;
    if (lacks(units + i, kTogether)) return false;
  }
  return !lacks(units + i, count - i);
}

LXUChar Repertoire::back(LXUChar unicode) const {
  const LXWChar code = LXCpUnicodeToCharW(codepage_.object(), unicode);
  return substitution_.stands_for(unicode, code) ? kReplacement : value_of(code);
}

/// A shift byte has no value of its own.
LXUChar Repertoire::value_of(LXWChar code) const {
  return code > 0xFF ? LXCpMbToUnicodeW(codepage_.object(), code) : single_[code];
}

LossKind Repertoire::kind_of_loss(LXUChar unicode) const {
  // Half a surrogate pair comes back from UTF-8, and is none of its characters.
  const LXUChar other = back(unicode);
  return other == kReplacement || other == unicode ? LossKind::kLacking : LossKind::kChanged;
}

std::string Repertoire::describe_loss(LXUChar unicode) const {
  if (kind_of_loss(unicode) == LossKind::kLacking) return lacks_text(unicode, codepage_.name());
  return code_point_name(unicode) + " becomes " + code_point_name(back(unicode)) + " in " + codepage_.name();
}

std::string lacks_text(uint32_t code_point, const std::string& codepage) {
  return code_point_name(code_point) + " is not in " + codepage;
}

}  // namespace lexicor_cli
