// ICU's converters through ucnv, and glibc's through iconv.
#include "converter.h"

#include <gnu/libc-version.h>
#include <iconv.h>
#include <unicode/ucnv.h>
#include <unicode/utf16.h>

#include <cerrno>
#include <stdexcept>

namespace lexicor_import {
namespace {

constexpr int kMaxUnits = 16;  // code points or bytes that one character can give

class IcuConverter : public Converter {
 public:
  explicit IcuConverter(const std::string& name) : name_(name) {
    UErrorCode error = U_ZERO_ERROR;
    converter_ = ucnv_open(name.c_str(), &error);
    if (U_FAILURE(error)) throw std::runtime_error("ICU has no converter " + name);
    if (name != ucnv_getName(converter_, &error)) {
      throw std::runtime_error(name + " is not the converter's own name: " + ucnv_getName(converter_, &error));
    }
    ucnv_setFallback(converter_, true);
    ucnv_setToUCallBack(converter_, UCNV_TO_U_CALLBACK_STOP, nullptr, nullptr, nullptr, &error);
    ucnv_setFromUCallBack(converter_, UCNV_FROM_U_CALLBACK_STOP, nullptr, nullptr, nullptr, &error);
  }
  ~IcuConverter() override { ucnv_close(converter_); }

  Decoding decode(const Bytes& bytes, uint32_t& unicode) override {
    UChar units[kMaxUnits];
    UErrorCode error = U_ZERO_ERROR;
    const int32_t count =
        ucnv_toUChars(converter_, units, kMaxUnits, reinterpret_cast<const char*>(bytes.data()),
                      static_cast<int32_t>(bytes.size()), &error);
    if (error == U_TRUNCATED_CHAR_FOUND) return Decoding::kCut;
    if (U_FAILURE(error) || count == 0) return Decoding::kNone;
    int32_t at = 0;
    UChar32 value;
    U16_NEXT(units, at, count, value);
    unicode = static_cast<uint32_t>(value);
    return at == count ? Decoding::kCharacter : Decoding::kSequence;
  }

  Bytes encode(uint32_t unicode) override {
    UErrorCode error = U_ZERO_ERROR;
    UChar units[2];
    int32_t count = 0;
    U16_APPEND_UNSAFE(units, count, static_cast<UChar32>(unicode));
    char bytes[kMaxUnits];
    const int32_t length = ucnv_fromUChars(converter_, bytes, kMaxUnits, units, count, &error);
    if (U_FAILURE(error)) return {};
    return Bytes(bytes, bytes + length);
  }

  bool is_shift_stateful() const override { return ucnv_getType(converter_) == UCNV_EBCDIC_STATEFUL; }
  std::string description() const override { return "ICU " U_ICU_VERSION " " + name_; }

 private:
  std::string name_;
  UConverter* converter_ = nullptr;
};

class IconvConverter : public Converter {
 public:
  explicit IconvConverter(const std::string& name)
      : name_(name),
        decoder_(iconv_open("UTF-32LE", name.c_str())),
        encoder_(iconv_open(name.c_str(), "UTF-32LE")) {
    if (decoder_ == kInvalid || encoder_ == kInvalid) throw std::runtime_error("iconv has no table " + name);
  }
  ~IconvConverter() override {
    iconv_close(decoder_);
    iconv_close(encoder_);
  }

  Decoding decode(const Bytes& bytes, uint32_t& unicode) override {
    uint8_t out[4 * kMaxUnits];
    const Result result = convert(decoder_, bytes, out, sizeof out);
    if (result.error == EINVAL) return Decoding::kCut;
    if (result.error != 0 || result.bytes < 4) return Decoding::kNone;
    unicode = static_cast<uint32_t>(out[0] | out[1] << 8 | out[2] << 16);
    return result.bytes == 4 ? Decoding::kCharacter : Decoding::kSequence;
  }

  Bytes encode(uint32_t unicode) override {
    uint8_t out[kMaxUnits];
    const Bytes in{static_cast<uint8_t>(unicode), static_cast<uint8_t>(unicode >> 8),
                   static_cast<uint8_t>(unicode >> 16), 0};
    const Result result = convert(encoder_, in, out, sizeof out);
    if (result.error != 0) return {};
    return Bytes(out, out + result.bytes);
  }

  bool is_shift_stateful() const override { return false; }
  std::string description() const override {
    return std::string("glibc ") + gnu_get_libc_version() + " " + name_;
  }

 private:
  struct Result {
    int error;
    size_t bytes;
  };

  static Result convert(iconv_t converter, Bytes in, uint8_t* out, size_t size) {
    char* from = reinterpret_cast<char*>(in.data());
    size_t from_left = in.size();
    char* to = reinterpret_cast<char*>(out);
    size_t left = size;
    iconv(converter, nullptr, nullptr, nullptr, nullptr);
    errno = 0;
    bool failed = iconv(converter, &from, &from_left, &to, &left) == static_cast<size_t>(-1);
    if (!failed) failed = iconv(converter, nullptr, nullptr, &to, &left) == static_cast<size_t>(-1);
    return {failed ? errno : 0, size - left};
  }

  static inline const iconv_t kInvalid = reinterpret_cast<iconv_t>(-1);
  std::string name_;
  iconv_t decoder_;
  iconv_t encoder_;
};

}  // namespace

std::unique_ptr<Converter> open_converter(const Codepage& codepage) {
  if (codepage.origin == kGlibc) return std::make_unique<IconvConverter>(codepage.table);
  return std::make_unique<IcuConverter>(codepage.table);
}

}  // namespace lexicor_import
