// Letters stand in a language's list about as often as they occur in it; ideographs are drawn from a list with
// the front preferred, as common characters are few and rare ones many.
#include "texts.h"

#include <unicode/ustring.h>

#include <cstdint>

namespace bench {
namespace {

constexpr const char16_t* kEnglishLetters =
    u"eeeeeeeeeeeetttttttttaaaaaaaaooooooooiiiiiiinnnnnnnsssssshhhhhhrrrrrrddddlllluuucccmmmwwffggyyppbbvk";
constexpr const char16_t* kGermanLetters =
    u"eeeeeeeeeeeeeeeeennnnnnnnnniiiiiiiisssssssrrrrrrraaaaaattttttdddddhhhhhuuuulllcccgggmmoobbwwffkkzpväüöß";
constexpr const char16_t* kRussianLetters =
    u"ооооооооооееееееееааааааааииииииинннннннттттттссссссррррррввввлллккккмммдддпппууяяыыььггззббччйххжшюцщэф";
constexpr const char16_t* kHiragana =
    u"のにたいをはとるがしてでなあれさかもうらりこすきくっだよまそつえわけちどみせおめじ";
constexpr const char16_t* kKatakana = u"ンスルトリアクイラシタロムレコドフバグサメプテカニ";

struct Recipe {
  const char16_t* letters;
  char16_t first_ideograph, last_ideograph;  // 0: written with letters
  bool spaces;                               // between words of the language
  const char16_t* stops;
};

const Recipe& recipe_of(Language language) {
  static constexpr Recipe kRecipes[] = {
      {kGermanLetters, 0, 0, true, u",.;:"},
      {kRussianLetters, 0, 0, true, u",.;:"},
      {kHiragana, 0x4E00, 0x9F00, false, u"、。"},
      {u"", 0x4E00, 0x9F00, false, u"，。"},
  };
  return kRecipes[static_cast<size_t>(language)];
}

class Generator {
 public:
  Generator(const Recipe& recipe, Mixture mixture, const CharBytes& char_bytes)
      : mixture_(mixture), char_bytes_(char_bytes), spaces_(recipe.spaces) {
    english_ = usable(kEnglishLetters);
    letters_ = usable(recipe.letters);
    katakana_ = recipe.letters == kHiragana ? usable(kKatakana) : u"";
    stops_ = usable(recipe.stops);
    digits_ = usable(u"0123456789");
    // Every 7th: a vocabulary of common size that is spread over the block as real ones are.
    for (char16_t c = recipe.first_ideograph; c < recipe.last_ideograph; c = static_cast<char16_t>(c + 7))
      if (char_bytes_(c) != 0) ideographs_.push_back(c);
  }

  std::u16string make(size_t bytes) {
    while (bytes_ < bytes) {
      switch (mixture_) {
        case Mixture::kNative:
          native_phrase();
          break;
        case Mixture::kAscii:
          ascii_phrase();
          break;
        case Mixture::kSparse:
          ascii_phrase();
          if (below(33) == 0) add(ideographs_.empty() ? letters_.back() : pick_common(ideographs_));
          break;
      }
    }
    add(u'.');
    return text_;
  }

 private:
  uint32_t below(uint32_t limit) {
    state_ ^= state_ << 13;
    state_ ^= state_ >> 7;
    state_ ^= state_ << 17;
    return static_cast<uint32_t>((state_ >> 32) * limit >> 32);
  }
  char16_t pick(const std::u16string& from) { return from[below(static_cast<uint32_t>(from.size()))]; }
  char16_t pick_common(const std::u16string& from) {
    const uint32_t size = static_cast<uint32_t>(from.size());
    return from[below(below(size) + 1)];
  }
  std::u16string usable(const char16_t* list) const {
    std::u16string kept;
    for (; *list != 0; ++list)
      if (char_bytes_(*list) != 0) kept.push_back(*list);
    return kept;
  }
  void add(char16_t c) {
    text_.push_back(c);
    bytes_ += char_bytes_(c);
  }
  void add_some(const std::u16string& from, uint32_t least, uint32_t spread) {
    for (uint32_t n = least + below(spread); n > 0; --n) add(pick(from));
  }

  void ascii_phrase() {
    if (below(10) == 0)
      add_some(digits_, 1, 5);
    else
      add_some(english_, 1, 9);
    if (below(10) == 0) add(u',');
    add(u' ');
  }
  void native_phrase() {
    const uint32_t kind = below(20);
    if (kind == 0) {
      add_some(digits_, 1, 5);
    } else if (kind == 1) {
      add_some(english_, 3, 7);
    } else if (ideographs_.empty()) {
      add_some(letters_, 2, 10);
    } else {
      native_cjk_words();
    }
    if (below(8) == 0) add(pick(stops_));
    if (spaces_ || kind <= 1) add(u' ');
  }
  void native_cjk_words() {
    for (uint32_t n = 1 + below(3); n > 0; --n) add(pick_common(ideographs_));
    if (!letters_.empty()) add_some(letters_, 1, 4);
    if (!katakana_.empty() && below(6) == 0) add_some(katakana_, 3, 4);
  }

  Mixture mixture_;
  const CharBytes& char_bytes_;
  bool spaces_;
  std::u16string english_, letters_, katakana_, stops_, digits_, ideographs_, text_;
  size_t bytes_ = 0;
  uint64_t state_ = 0x9E3779B97F4A7C15;
};

}  // namespace

std::u16string make_text(Language language, Mixture mixture, const CharBytes& char_bytes, size_t bytes) {
  return Generator(recipe_of(language), mixture, char_bytes).make(bytes);
}

size_t utf8_bytes(char16_t c) {
  return c < 0x80 ? 1 : c < 0x800 ? 2 : 3;
}

std::string to_utf8(const std::u16string& text) {
  std::string bytes(3 * text.size(), '\0');
  int32_t count = 0;
  UErrorCode error = U_ZERO_ERROR;
  u_strToUTF8(bytes.data(), static_cast<int32_t>(bytes.size()), &count, text.data(),
              static_cast<int32_t>(text.size()), &error);
  bytes.resize(static_cast<size_t>(count));
  return bytes;
}

}  // namespace bench
