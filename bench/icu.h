// What ICU and libunistring do beside the library. In a build without them all of it is empty.
#pragma once

#include <functional>

#include "codepages.h"
#include "message_work.h"
#include "table.h"
#include "words.h"

namespace bench::icu {

/// The versions of ICU and libunistring, each behind a comma; empty without them.
std::string versions();

/// Whether ICU writes a character as these bytes, and reads them as this character; true without ICU.
bool reads_and_writes(const Encoding& encoding, const std::string& bytes, char16_t c);

/// Conversion of every piece, with converters that stay open: with a pivot between two codepages.
Work convert(const Input& input, const Encoding& from, const Encoding& to);
/// The functions for UTF-8 and UTF-16 alone.
Work convert_utf(const Input& input, const Encoding& from, const Encoding& to);
/// Upper or lower case of every piece by the rules of a language: text of a codepage goes through UTF-16.
Work map(const Input& input, const Encoding& encoding, const char* language, bool is_upper);

/// The characters of every piece: with U8_FWD_1 in UTF-8, elsewhere by conversion to UTF-16.
Work count_chars(const Input& input, const Encoding& encoding);
/// Their code points too: with U8_NEXT, or ucnv_getNextUChar.
Work walk(const Input& input, const Encoding& encoding);
/// Comparison and keys by a language's order, with punctuation on the fourth level as the shipped sorts have
/// it.
Work order_utf16(Order order, const Words& words, const char* language);
Work order_utf8(Order order, const Words& words, const char* language);
Work keys(const Words& words, const char* language);
/// Neighbours compared by code value without regard to case.
Work order_caseless(const Words& words);
Work find(const std::shared_ptr<const std::u16string>& text);

/// Messages of the resource bundle in a directory, by their index, in an encoding.
Work messages(const std::string& directory, const Encoding* encoding, const std::vector<int>& numbers);

/// Opens a converter, a collator and a format for German, and uses each once; false when that fails.
std::function<bool()> first_use(const char* word, const char* other, double amount);

/// What writes a number or a moment as UTF-16 to a buffer of `room` units, and gives the units. `territory` is
/// a locale as "de_DE". In a build without ICU they are empty, as are the readers.
template <class Value>
using Writer = std::function<int32_t(Value value, char16_t* output, int32_t room)>;
Writer<int32_t> integer_writer(const char* territory);
Writer<double> double_writer(const char* territory);
Writer<double> currency_writer(const char* territory);
/// Milliseconds since 1970 by a pattern.
Writer<double> time_writer(const char* territory, const char16_t* pattern);

template <class Value>
using Reader = std::function<Value(const std::u16string& text)>;
Reader<int32_t> integer_reader(const char* territory);
Reader<double> double_reader(const char* territory);
Reader<double> time_reader(const char* territory, const char16_t* pattern);

}  // namespace bench::icu

namespace bench::unistring {

std::string version();

/// u8_to_u16 and u16_to_u8.
Work convert(const Input& input, const Encoding& from, const Encoding& to);
/// u8_toupper, u16_tolower and so on.
Work map(const Input& input, const Encoding& encoding, const char* language, bool is_upper);
/// u8_mbsnlen, and u8_mbtouc.
Work count_chars(const Input& input, const Encoding& encoding);
Work walk(const Input& input, const Encoding& encoding);

}  // namespace bench::unistring
