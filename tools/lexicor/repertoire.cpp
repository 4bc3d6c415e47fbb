// Every value is written and read back once; texts are then looked up in a bit set.
#include "repertoire.h"

#include <cstdint>

#include "hex.h"

namespace lexicor_cli {

namespace {

constexpr bool is_surrogate(uint32_t unicode) {
  return unicode >= 0xD800 && unicode <= 0xDFFF;
}

}  // namespace

Repertoire::Repertoire(const Codepage& codepage)
    : codepage_(codepage), substitution_(codepage), single_(single_byte_values(codepage)) {
  watched_.fill(~uint64_t{0});
}

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
  for (uint32_t word = page * kPage / kWordBits; word < (page + 1) * kPage / kWordBits; ++word) {
    watched_[word] = 0;
    for (uint32_t bit = 0; bit < kWordBits; ++bit) {
      const uint32_t unicode = word * kWordBits + bit;
      lost_[unicode] = is_lost(static_cast<LXUChar>(unicode));
      if (lost_[unicode] || asked_[unicode]) watched_[word] |= uint64_t{1} << bit;
    }
  }
}

void Repertoire::learn_pages(const LXUChar* units, size_t count) const {
  for (size_t i = 0; i < count; ++i) learn_page(units[i] / kPage);
}

void Repertoire::watch(LXUChar unicode) {
  asked_.set(unicode);
  watched_[unicode / kWordBits] |= uint64_t{1} << unicode % kWordBits;
}

bool Repertoire::has_all(const LXUChar* units, size_t count) const {
  constexpr size_t kTogether = 16;
  const auto any_watched = [&](const LXUChar* some, size_t some_count) {
    uint64_t watched = 0;
    for (size_t i = 0; i < some_count; ++i) watched |= watched_[some[i] / kWordBits] >> some[i] % kWordBits;
    return (watched & 1) != 0;
  };
  const auto lacks = [&](const LXUChar* some, size_t some_count) {
    if (!any_watched(some, some_count)) return false;
    learn_pages(some, some_count);
    return any_watched(some, some_count);
  };
  size_t i = 0;
  for (; count - i >= kTogether; i += kTogether) {
    unsigned all_bits = 0;
    for (size_t k = i; k < i + kTogether; ++k) all_bits |= units[k];
    const bool ascii = all_bits < kAscii && (watched_[0] | watched_[1]) == 0;
    if (!ascii && lacks(units + i, kTogether)) return false;
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
