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
  for (uint32_t unicode = 0; unicode < kValues; ++unicode) {
    const auto unit = static_cast<LXUChar>(unicode);
    if (codepage.utf8()) {
      lost_[unicode] = is_surrogate(unicode);
      continue;
    }
    const LXWChar code = LXCpUnicodeToCharW(codepage.object(), unit);
    lost_[unicode] = substitution_.stands_for(unit, code) || value_of(code) != unit;
  }
  for (uint32_t unicode = 0; unicode < kValues; ++unicode) {
    if (lost_[unicode]) watched_[unicode / kWordBits] |= uint64_t{1} << unicode % kWordBits;
  }
  learn_ascii();
}

void Repertoire::watch(LXUChar unicode) {
  watched_[unicode / kWordBits] |= uint64_t{1} << unicode % kWordBits;
  learn_ascii();
}

void Repertoire::learn_ascii() {
  has_ascii_ = (watched_[0] | watched_[1]) == 0;
}

bool Repertoire::has_all(const LXUChar* units, size_t count) const {
  constexpr size_t kTogether = 16;
  const auto any_watched = [&](size_t begin, size_t end) {
    uint64_t watched = 0;
    for (size_t i = begin; i < end; ++i) watched |= watched_[units[i] / kWordBits] >> units[i] % kWordBits;
    return (watched & 1) != 0;
  };
  size_t i = 0;
  for (; count - i >= kTogether; i += kTogether) {
    unsigned all_bits = 0;
    for (size_t k = i; k < i + kTogether; ++k) all_bits |= units[k];
    if ((all_bits >= kAscii || !has_ascii_) && any_watched(i, i + kTogether)) return false;
  }
  return !any_watched(i, count);
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
