#include "mutants.h"

#include <cstdio>
#include <iterator>
#include <random>

namespace mutate {
namespace {

constexpr size_t kByteValues = 5;

/// What a field of 16 or 32 bits is set to, beside its value one more and one less, and the file's size.
constexpr uint32_t kWords[] = {0, 1, 0xFF, 0x100, 0x7FFF, 0x8000, 0xFFFE, 0xFFFF};
constexpr uint32_t kLongs[] = {0, 1, 0xFFFF, 0x10000, 0x7FFFFFFF, 0x80000000, 0xFFFFFFFE, 0xFFFFFFFF};
constexpr size_t kFieldValues = std::size(kWords) + 4;
static_assert(std::size(kWords) == std::size(kLongs), "both tables go by one number");

size_t fields(size_t file_bytes, size_t field_bytes) {
  return file_bytes < field_bytes ? 0 : (file_bytes - field_bytes) / 2 + 1;
}

}  // namespace

Mutants::Mutants(ByteString whole, bool big_endian, uint32_t seed, size_t random_changes)
    : whole_(std::move(whole)),
      big_endian_(big_endian),
      seed_(seed),
      bytes_(whole_.size() * kByteValues),
      words_(fields(whole_.size(), 2) * kFieldValues),
      longs_(fields(whole_.size(), 4) * kFieldValues),
      cuts_(whole_.size()),
      random_(random_changes) {}

uint32_t Mutants::field(size_t at, size_t bytes) const {
  uint32_t value = 0;
  for (size_t i = 0; i < bytes; ++i) value = value << 8 | whole_[big_endian_ ? at + i : at + bytes - 1 - i];
  return value;
}

void Mutants::put(ByteString* file, const Change& change) const {
  for (size_t i = 0; i < change.bytes; ++i) {
    const size_t place = big_endian_ ? change.bytes - 1 - i : i;
    (*file)[change.at + place] = static_cast<uint8_t>(change.value >> 8 * i);
  }
}

/// What a field of so many bytes is set to, of its values the one with this number.
uint32_t Mutants::value(size_t at, size_t bytes, size_t which) const {
  const uint32_t old = field(at, bytes), size = static_cast<uint32_t>(whole_.size());
  if (bytes == 1) {
    const uint32_t values[kByteValues] = {0x00, 0xFF, old + 1, old - 1, old ^ 0x80};
    return values[which] & 0xFF;
  }
  const uint32_t near[] = {old + 1, old - 1, size, size - 1};
  constexpr size_t kTable = std::size(kWords);
  if (bytes == 2) return (which < kTable ? kWords[which] : near[which - kTable]) & 0xFFFF;
  return which < kTable ? kLongs[which] : near[which - kTable];
}

Mutants::Change Mutants::change(size_t number) const {
  if (number < bytes_) return {number / kByteValues, 1, value(number / kByteValues, 1, number % kByteValues)};
  number -= bytes_;
  if (number >= words_ + longs_) return {number - words_ - longs_, 0, 0};
  const size_t bytes = number < words_ ? 2 : 4;
  if (bytes == 4) number -= words_;
  const size_t at = number / kFieldValues * 2;
  return {at, bytes, value(at, bytes, number % kFieldValues)};
}

/// Whether a change of a field is one of half of it.
bool Mutants::is_of_half(const Change& change) const {
  if (change.bytes < 2) return false;
  const size_t half = change.bytes / 2;
  const uint32_t changed = change.value ^ field(change.at, change.bytes);
  const bool high = changed >> 8 * half != 0;
  if (high && (changed & ((1u << 8 * half) - 1)) != 0) return false;
  const size_t at = change.at + (high != big_endian_ ? half : 0);
  const uint32_t in_half = change.value >> (high ? 8 * half : 0) & ((1u << 8 * half) - 1);
  for (size_t which = 0; which < (half == 1 ? kByteValues : kFieldValues); ++which)
    if (value(at, half, which) == in_half) return true;
  return is_of_half({at, half, in_half});
}

void Mutants::change_at_random(size_t number, ByteString* mutant) const {
  std::mt19937 random(static_cast<uint32_t>(seed_ * 1000003 + number));
  for (size_t places = 1 + random() % 4; places > 0; --places) {
    const size_t at = random() % mutant->size(), from = random() % mutant->size();
    const bool copied = random() % 4 == 0;
    for (size_t i = 0, run = 1 + random() % 8; i < run && at + i < mutant->size(); ++i)
      (*mutant)[at + i] = copied ? whole_[(from + i) % whole_.size()] : static_cast<uint8_t>(random());
  }
}

bool Mutants::make(size_t number, ByteString* mutant) const {
  *mutant = whole_;
  if (number >= count() - random_) {
    change_at_random(number, mutant);
    return *mutant != whole_;
  }
  const Change made = change(number);
  if (made.bytes == 0) {
    mutant->resize(made.at);
    return true;
  }
  if (is_of_half(made)) return false;
  put(mutant, made);
  return *mutant != whole_;
}

std::string Mutants::name(size_t number) const {
  if (number >= count() - random_)
    return "places at random, seed " + std::to_string(seed_) + ", " + std::to_string(number);
  const Change made = change(number);
  if (made.bytes == 0) return "cut at " + std::to_string(made.at);
  char text[80];
  const int digits = static_cast<int>(2 * made.bytes);
  snprintf(text, sizeof(text), "offset %zu: %0*X in place of %0*X", made.at, digits,
           static_cast<unsigned>(made.bytes == 2 ? made.value & 0xFFFF : made.value), digits,
           static_cast<unsigned>(field(made.at, made.bytes)));
  return text;
}

}  // namespace mutate
