// The words of <uconv_class>.
#pragma once

#include "ucm.h"

namespace lexicor_data {

struct ClassWord {
  const char* text;
  CodepageClass kind;
};

inline constexpr ClassWord kClassWords[] = {
    {"SBCS", CodepageClass::kSingleByte},
    {"MBCS", CodepageClass::kMultiByte},
    {"EBCDIC_STATEFUL", CodepageClass::kShiftStateful},
};

inline const char* class_word(CodepageClass kind) {
  for (const ClassWord& word : kClassWords)
    if (word.kind == kind) return word.text;
  return "";
}

}  // namespace lexicor_data
