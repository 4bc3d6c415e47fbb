// Phrases are drawn again and again in another order, so that a long text does not repeat itself as its file is
// short.
#include "texts.h"

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <iterator>
#include <random>

namespace bench {
namespace {

constexpr size_t kTextUnits = 1100000;  // enough for a million bytes in any codepage
constexpr size_t kSparseUnits = 200;

struct Language {
  const char* label;
  const char* code;  // in the names of files
};
constexpr Language kLanguages[] = {
    {"English", "en"}, {"German", "de"},   {"French", "fr"},     {"Czech", "cs"},
    {"Swedish", "sv"}, {"Russian", "ru"},  {"Greek", "el"},      {"Thai", "th"},
    {"Korean", "ko"},  {"Japanese", "ja"}, {"Chinese", "zh_CN"}, {"Taiwan", "zh_TW"},
};

const char* code_of(const std::string& language) {
  for (const Language& known : kLanguages)
    if (language == known.label) return known.code;
  return "";
}

std::vector<std::u16string> lines_of(const std::u16string& text) {
  std::vector<std::u16string> lines;
  size_t start = 0;
  for (size_t end; (end = text.find(u'\n', start)) != std::u16string::npos; start = end + 1)
    if (end > start) lines.push_back(text.substr(start, end - start));
  return lines;
}

std::u16string drawn_phrases(std::vector<std::u16string> phrases) {
  std::mt19937 random(1);
  std::u16string text;
  while (text.size() < kTextUnits) {
    std::shuffle(phrases.begin(), phrases.end(), random);
    for (const std::u16string& phrase : phrases) text += phrase + u", ";
  }
  return text;
}

std::u16string repeated(const std::u16string& text) {
  std::u16string all;
  while (all.size() < kTextUnits) all += text;
  return all;
}

std::u16string only_ascii(const std::u16string& text) {
  std::u16string kept;
  for (const char16_t c : text)
    if (c < 0x80) kept += c;
  return kept;
}

std::u16string sparse(const std::u16string& ascii, const std::u16string& language) {
  std::u16string text;
  size_t next = 0;
  for (size_t at = 0; at < ascii.size(); at += kSparseUnits) {
    text.append(ascii, at, kSparseUnits);
    while (language[next] < 0x80) ++next;
    text += language[next++];
  }
  return text;
}

bool has_punctuation(const std::u16string& word) {
  return std::any_of(word.begin(), word.end(),
                     [](char16_t c) { return c < 0x80 && (c < u'A' || c > u'z' || (c > u'Z' && c < u'a')); });
}

bool take_prefix(std::string* label, const char* prefix) {
  if (label->compare(0, strlen(prefix), prefix) != 0) return false;
  label->erase(0, strlen(prefix));
  return true;
}

bool take_suffix(std::string* label, const char* suffix) {
  const size_t bytes = strlen(suffix);
  if (label->size() < bytes || label->compare(label->size() - bytes, bytes, suffix) != 0) return false;
  label->erase(label->size() - bytes);
  return true;
}

}  // namespace

const std::u16string& Texts::find(const std::string& label) {
  const auto place = known_.find(label);
  return place != known_.end() ? place->second : known_.emplace(label, make(label)).first->second;
}

std::vector<std::u16string> Texts::words(const std::string& language) {
  std::vector<std::u16string> words = lines_of(to_utf16(read("words", language)));
  words.erase(std::remove_if(words.begin(), words.end(), has_punctuation), words.end());
  std::sort(words.begin(), words.end());
  words.erase(std::unique(words.begin(), words.end()), words.end());
  std::mt19937 random(1);
  std::shuffle(words.begin(), words.end(), random);
  return words;
}

std::u16string Texts::make(const std::string& label) {
  std::string language = label;
  if (label == "ASCII") return only_ascii(find("English-prose"));
  if (take_prefix(&language, "sparse-")) {
    const std::u16string &ascii = find("ASCII"), &other = find(language);
    return ascii.empty() || other.empty() ? std::u16string() : sparse(ascii, other);
  }
  const bool is_prose = take_suffix(&language, "-prose");
  const std::u16string text = to_utf16(read(is_prose ? "prose" : "phrases", language));
  if (text.empty()) return text;
  return is_prose ? repeated(text) : drawn_phrases(lines_of(text));
}

std::string Texts::read(const std::string& kind, const std::string& language) {
  const std::string file_path = path(kind + "." + code_of(language));
  std::ifstream file(file_path, std::ios::binary);
  std::string bytes{std::istreambuf_iterator<char>(file), {}};
  if (bytes.empty())
    std::fprintf(stderr,
                 "%s: not there; its rows are left out. scripts/bench makes it, and names the package\n",
                 file_path.c_str());
  return bytes;
}

std::u16string to_utf16(const std::string& utf8) {
  std::u16string text;
  for (size_t i = 0; i < utf8.size();) {
    const auto byte = [&](size_t at) { return static_cast<unsigned>(static_cast<unsigned char>(utf8[at])); };
    const unsigned lead = byte(i);
    const size_t bytes = lead < 0x80 ? 1 : lead < 0xE0 ? 2 : lead < 0xF0 ? 3 : 4;
    if (i + bytes > utf8.size()) break;
    if (bytes == 1) text += static_cast<char16_t>(lead);
    if (bytes == 2) text += static_cast<char16_t>((lead & 0x1F) << 6 | (byte(i + 1) & 0x3F));
    if (bytes == 3)
      text += static_cast<char16_t>((lead & 0x0F) << 12 | (byte(i + 1) & 0x3F) << 6 | (byte(i + 2) & 0x3F));
    i += bytes;
  }
  return text;
}

std::string to_utf8(const std::u16string& text) {
  std::string bytes;
  const auto trail = [&](unsigned c) { bytes += static_cast<char>(0x80 | (c & 0x3F)); };
  for (const char16_t c : text) {
    if (c < 0x80) {
      bytes += static_cast<char>(c);
    } else if (c < 0x800) {
      bytes += static_cast<char>(0xC0 | c >> 6);
      trail(c);
    } else {
      bytes += static_cast<char>(0xE0 | c >> 12);
      trail(c >> 6);
      trail(c);
    }
  }
  return bytes;
}

std::string utf16_bytes(const std::u16string& text) {
  return std::string(reinterpret_cast<const char*>(text.data()), text.size() * sizeof(char16_t));
}

}  // namespace bench
