// The macro U8_NEXT converts as this would warn of.
#pragma GCC diagnostic ignored "-Wconversion"
#include "icu.h"

#include <unicode/ucasemap.h>
#include <unicode/ucnv.h>
#include <unicode/ucnv_err.h>
#include <unicode/ucol.h>
#include <unicode/udat.h>
#include <unicode/unum.h>
#include <unicode/ures.h>
#include <unicode/ustring.h>
#include <unicode/utf8.h>

#include <vector>

#include "keep.h"

namespace bench::icu {
namespace {

constexpr int32_t kPivotUnits = 1024;  // the size that ICU itself takes in ucnv_convert
constexpr size_t kCharRoom = 16;

using Converter = std::shared_ptr<UConverter>;

Converter open(const Encoding& encoding) {
  UErrorCode error = U_ZERO_ERROR;
  Converter converter(ucnv_open(encoding.icu, &error), ucnv_close);
  ucnv_setToUCallBack(converter.get(), UCNV_TO_U_CALLBACK_STOP, nullptr, nullptr, nullptr, &error);
  ucnv_setFromUCallBack(converter.get(), UCNV_FROM_U_CALLBACK_STOP, nullptr, nullptr, nullptr, &error);
  return U_SUCCESS(error) ? converter : nullptr;
}

char16_t* units(char* bytes) {
  return reinterpret_cast<char16_t*>(bytes);
}
const char16_t* units(const char* bytes) {
  return reinterpret_cast<const char16_t*>(bytes);
}

std::shared_ptr<UCollator> open_collator(const char* language) {
  UErrorCode error = U_ZERO_ERROR;
  std::shared_ptr<UCollator> collator(ucol_open(language, &error), ucol_close);
  ucol_setAttribute(collator.get(), UCOL_ALTERNATE_HANDLING, UCOL_SHIFTED, &error);
  ucol_setAttribute(collator.get(), UCOL_STRENGTH, UCOL_QUATERNARY, &error);
  return collator;
}

}  // namespace

std::string versions() {
  return ", ICU " U_ICU_VERSION ", libunistring " + unistring::version();
}

bool reads_and_writes(const Encoding& encoding, const std::string& bytes, char16_t c) {
  static std::pair<const Encoding*, Converter> last;
  if (last.first != &encoding) last = {&encoding, open(encoding)};
  UErrorCode error = U_ZERO_ERROR;
  char written[kCharRoom];
  char16_t read[kCharRoom];
  const int32_t n = ucnv_fromUChars(last.second.get(), written, sizeof(written), &c, 1, &error);
  const int32_t m =
      ucnv_toUChars(last.second.get(), read, kCharRoom, bytes.data(), length(bytes.size()), &error);
  return U_SUCCESS(error) && bytes == std::string(written, count(n)) && m == 1 && read[0] == c;
}

Work convert(const Input& input, const Encoding& from, const Encoding& to) {
  const Converter source = open(from), target = open(to);
  if (source == nullptr || target == nullptr) return nullptr;
  if (is_utf16(to))
    return for_each_piece(input, [source](const char* in, size_t bytes, char* out) {
      UErrorCode error = U_ZERO_ERROR;
      return 2 * count(ucnv_toUChars(source.get(), units(out), length(bytes) + 1, in, length(bytes), &error));
    });
  if (is_utf16(from))
    return for_each_piece(input, [target](const char* in, size_t bytes, char* out) {
      UErrorCode error = U_ZERO_ERROR;
      return count(
          ucnv_fromUChars(target.get(), out, length(2 * bytes) + 1, units(in), length(bytes / 2), &error));
    });
  return for_each_piece(input, [source, target](const char* in, size_t bytes, char* out) {
    char16_t pivot[kPivotUnits];
    char16_t *pivot_source = pivot, *pivot_target = pivot;
    char* end = out;
    UErrorCode error = U_ZERO_ERROR;
    ucnv_convertEx(target.get(), source.get(), &end, out + 6 * bytes + 8, &in, in + bytes, pivot, &pivot_source,
                   &pivot_target, pivot + kPivotUnits, true, true, &error);
    return static_cast<size_t>(end - out);
  });
}

Work convert_utf(const Input& input, const Encoding& from, const Encoding& to) {
  if (is_utf8(from) && is_utf16(to))
    return for_each_piece(input, [](const char* in, size_t bytes, char* out) {
      UErrorCode error = U_ZERO_ERROR;
      int32_t written = 0;
      u_strFromUTF8(units(out), length(bytes), &written, in, length(bytes), &error);
      return 2 * count(written);
    });
  if (is_utf16(from) && is_utf8(to))
    return for_each_piece(input, [](const char* in, size_t bytes, char* out) {
      UErrorCode error = U_ZERO_ERROR;
      int32_t written = 0;
      u_strToUTF8(out, length(2 * bytes), &written, units(in), length(bytes / 2), &error);
      return count(written);
    });
  return nullptr;
}

Work map(const Input& input, const Encoding& encoding, const char* language, bool is_upper) {
  if (is_utf8(encoding)) {
    UErrorCode error = U_ZERO_ERROR;
    const std::shared_ptr<UCaseMap> cases(ucasemap_open(language, 0, &error), ucasemap_close);
    const auto convert = is_upper ? ucasemap_utf8ToUpper : ucasemap_utf8ToLower;
    return for_each_piece(input, [cases, convert](const char* in, size_t bytes, char* out) {
      UErrorCode failed = U_ZERO_ERROR;
      return count(convert(cases.get(), out, length(2 * bytes), in, length(bytes), &failed));
    });
  }
  const auto convert = is_upper ? u_strToUpper : u_strToLower;
  if (is_utf16(encoding))
    return for_each_piece(input, [language, convert](const char* in, size_t bytes, char* out) {
      UErrorCode error = U_ZERO_ERROR;
      return 2 * count(convert(units(out), length(bytes), units(in), length(bytes / 2), language, &error));
    });
  const Converter converter = open(encoding);
  if (converter == nullptr) return nullptr;
  auto room = std::make_shared<std::vector<char16_t>>(4 * input->bytes.size() + 2);
  return for_each_piece(input, [converter, room, language, convert](const char* in, size_t bytes, char* out) {
    UErrorCode error = U_ZERO_ERROR;
    char16_t *const read = room->data(), *const mapped = read + 2 * bytes;
    const int32_t units_read =
        ucnv_toUChars(converter.get(), read, length(2 * bytes), in, length(bytes), &error);
    const int32_t units_mapped = convert(mapped, length(2 * bytes), read, units_read, language, &error);
    return count(ucnv_fromUChars(converter.get(), out, length(2 * bytes), mapped, units_mapped, &error));
  });
}

Work count_chars(const Input& input, const Encoding& encoding) {
  if (is_utf8(encoding))
    return sum_of_pieces(input, [](const char* text, size_t bytes) {
      size_t chars = 0;
      for (size_t i = 0; i < bytes; ++chars) U8_FWD_1(text, i, bytes);
      return chars;
    });
  const Converter converter = open(encoding);
  if (converter == nullptr) return nullptr;
  auto room = std::make_shared<std::vector<char16_t>>(input->bytes.size());
  return sum_of_pieces(input, [converter, room](const char* text, size_t bytes) {
    UErrorCode error = U_ZERO_ERROR;
    return count(
        ucnv_toUChars(converter.get(), room->data(), length(room->size()), text, length(bytes), &error));
  });
}

Work walk(const Input& input, const Encoding& encoding) {
  if (is_utf8(encoding))
    return sum_of_pieces(input, [](const char* text, size_t bytes) {
      size_t chars = 0;
      UChar32 codes = 0;
      for (size_t i = 0; i < bytes; ++chars) {
        UChar32 c = 0;
        U8_NEXT(text, i, bytes, c);
        codes += c;
      }
      keep(codes);
      return chars;
    });
  const Converter converter = open(encoding);
  if (converter == nullptr) return nullptr;
  return sum_of_pieces(input, [converter](const char* text, size_t bytes) {
    UErrorCode error = U_ZERO_ERROR;
    size_t chars = 0;
    UChar32 codes = 0;
    ucnv_resetToUnicode(converter.get());
    for (const char* const end = text + bytes; text < end; ++chars)
      codes += ucnv_getNextUChar(converter.get(), &text, end, &error);
    keep(codes);
    return chars;
  });
}

Work order_utf16(Order order, const Words& words, const char* language) {
  return order_work(order, words, [collator = open_collator(language)](const Word& a, const Word& b) {
    return static_cast<int>(ucol_strcoll(collator.get(), a.units.data(), length(a.units.size()), b.units.data(),
                                         length(b.units.size())));
  });
}

Work order_utf8(Order order, const Words& words, const char* language) {
  return order_work(order, words, [collator = open_collator(language)](const Word& a, const Word& b) {
    UErrorCode error = U_ZERO_ERROR;
    return static_cast<int>(ucol_strcollUTF8(collator.get(), a.utf8.data(), length(a.utf8.size()),
                                             b.utf8.data(), length(b.utf8.size()), &error));
  });
}

Work keys(const Words& words, const char* language) {
  return key_work(words, [collator = open_collator(language)](const Word& word, char* out) {
    return count(ucol_getSortKey(collator.get(), word.units.data(), length(word.units.size()),
                                 reinterpret_cast<uint8_t*>(out), kKeyBytes));
  });
}

Work order_caseless(const Words& words) {
  return order_work(Order::kNeighbours, words, [](const Word& a, const Word& b) {
    UErrorCode error = U_ZERO_ERROR;
    return static_cast<int>(u_strCaseCompare(a.units.data(), length(a.units.size()), b.units.data(),
                                             length(b.units.size()), U_FOLD_CASE_DEFAULT, &error));
  });
}

Work find(const std::shared_ptr<const std::u16string>& text) {
  return find_work(text, [](const std::u16string& all, const std::u16string& part) {
    return u_strFindFirst(all.data(), length(all.size()), part.data(), length(part.size())) != nullptr;
  });
}

Work messages(const std::string& directory, const Encoding* encoding, const std::vector<int>& numbers) {
  UErrorCode error = U_ZERO_ERROR;
  const std::shared_ptr<UResourceBundle> bundle(ures_openDirect(directory.c_str(), "root", &error), ures_close);
  const std::shared_ptr<UResourceBundle> texts(ures_getByKey(bundle.get(), "messages", nullptr, &error),
                                               ures_close);
  const Converter converter = open(*encoding);
  if (U_FAILURE(error)) return nullptr;
  if (is_utf8(*encoding))
    return message_work(numbers, [bundle, texts](int number, char* out) {
      UErrorCode failed = U_ZERO_ERROR;
      int32_t room = kMessageRoom;
      ures_getUTF8StringByIndex(texts.get(), number - 1, out, &room, true, &failed);
    });
  if (is_utf16(*encoding))
    return message_work(numbers, [bundle, texts](int number, char* out) {
      UErrorCode failed = U_ZERO_ERROR;
      int32_t count = 0;
      const char16_t* const text = ures_getStringByIndex(texts.get(), number - 1, &count, &failed);
      u_memcpy(units(out), text, count + 1);
    });
  return message_work(numbers, [bundle, texts, converter](int number, char* out) {
    UErrorCode failed = U_ZERO_ERROR;
    int32_t count = 0;
    const char16_t* const text = ures_getStringByIndex(texts.get(), number - 1, &count, &failed);
    ucnv_fromUChars(converter.get(), out, kMessageRoom, text, count, &failed);
  });
}

std::function<bool()> first_use(const char* word, const char* other, double amount) {
  return [word, other, amount] {
    UErrorCode error = U_ZERO_ERROR;
    char16_t out[64];
    ucnv_toUChars(ucnv_open("UTF-8", &error), out, 64, word, -1, &error);
    const UCollationResult order = ucol_strcollUTF8(ucol_open("de", &error), word, -1, other, -1, &error);
    unum_formatDouble(unum_open(UNUM_CURRENCY, nullptr, 0, "de_DE", nullptr, &error), amount, out, 64, nullptr,
                      &error);
    return U_SUCCESS(error) && order != UCOL_EQUAL;
  };
}

namespace {

using Numbers = std::shared_ptr<UNumberFormat>;
using Times = std::shared_ptr<UDateFormat>;

Numbers open_numbers(const char* territory, UNumberFormatStyle style, int32_t fraction_digits) {
  UErrorCode error = U_ZERO_ERROR;
  Numbers numbers(unum_open(style, nullptr, 0, territory, nullptr, &error), unum_close);
  unum_setAttribute(numbers.get(), UNUM_FRACTION_DIGITS, fraction_digits);
  return numbers;
}

Times open_times(const char* territory, const char16_t* pattern) {
  UErrorCode error = U_ZERO_ERROR;
  return {udat_open(UDAT_PATTERN, UDAT_PATTERN, territory, u"GMT", -1, pattern, -1, &error), udat_close};
}

Writer<double> write_doubles(const Numbers& numbers) {
  return [numbers](double value, char16_t* out, int32_t room) {
    UErrorCode error = U_ZERO_ERROR;
    return unum_formatDouble(numbers.get(), value, out, room, nullptr, &error);
  };
}

}  // namespace

Writer<int32_t> integer_writer(const char* territory) {
  return [numbers = open_numbers(territory, UNUM_DECIMAL, 0)](int32_t value, char16_t* out, int32_t room) {
    UErrorCode error = U_ZERO_ERROR;
    return unum_format(numbers.get(), value, out, room, nullptr, &error);
  };
}

Writer<double> double_writer(const char* territory) {
  return write_doubles(open_numbers(territory, UNUM_DECIMAL, 2));
}

Writer<double> currency_writer(const char* territory) {
  return write_doubles(open_numbers(territory, UNUM_CURRENCY, 2));
}

Writer<double> time_writer(const char* territory, const char16_t* pattern) {
  return [times = open_times(territory, pattern)](double value, char16_t* out, int32_t room) {
    UErrorCode error = U_ZERO_ERROR;
    return udat_format(times.get(), value, out, room, nullptr, &error);
  };
}

Reader<int32_t> integer_reader(const char* territory) {
  return [numbers = open_numbers(territory, UNUM_DECIMAL, 0)](const std::u16string& text) {
    UErrorCode error = U_ZERO_ERROR;
    return unum_parse(numbers.get(), text.data(), length(text.size()), nullptr, &error);
  };
}

Reader<double> double_reader(const char* territory) {
  return [numbers = open_numbers(territory, UNUM_DECIMAL, 2)](const std::u16string& text) {
    UErrorCode error = U_ZERO_ERROR;
    return unum_parseDouble(numbers.get(), text.data(), length(text.size()), nullptr, &error);
  };
}

Reader<double> time_reader(const char* territory, const char16_t* pattern) {
  return [times = open_times(territory, pattern)](const std::u16string& text) {
    UErrorCode error = U_ZERO_ERROR;
    return udat_parse(times.get(), text.data(), length(text.size()), nullptr, &error);
  };
}

}  // namespace bench::icu
