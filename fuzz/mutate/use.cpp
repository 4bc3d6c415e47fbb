#include "use.h"

#include <fcntl.h>
#include <unistd.h>

#include <cstdlib>
#include <cstring>

#include "core/lxcatformat.h"

namespace mutate {
namespace {

using lx::test::ScratchDirectory;
using lx::test::Units;

constexpr size_t kMostCharBytes = 4;

/// What is out of the library's hands, and the most that it asked for at once: no file of a directory needs more.
struct Blocks {
  static constexpr size_t kMost = size_t{16} << 20;

  size_t live = 0;
  size_t largest = 0;

  static void* allocate(void* context, size_t bytes) {
    Blocks& self = *static_cast<Blocks*>(context);
    ++self.live;
    if (bytes > self.largest) self.largest = bytes;
    return malloc(bytes);
  }
  static int32_t release(void* context, void* block) {
    --static_cast<Blocks*>(context)->live;
    free(block);
    return 1;
  }
};

int next_descriptor() {
  const int descriptor = open("/dev/null", O_RDONLY);
  close(descriptor);
  return descriptor;
}

struct Releaser {
  void operator()(LXLocale* locale) const { LXReleaseLocale(locale); }
};
using LocalePtr = std::unique_ptr<LXLocale, Releaser>;

/// One character at the very end of a block, with the bytes that its first one calls for.
void use_character(LXLocale* locale, const LXObject* codepage, unsigned first, Random& random, size_t width) {
  char lead = static_cast<char>(first);
  const size_t length = static_cast<size_t>(LXByteLength(locale, &lead));
  must(length >= 1 && length <= width, "a character has 1 to the width of bytes");
  const size_t bytes = length < 2 ? width : length;
  Exact<char> block(bytes), out(kMostCharBytes);
  for (size_t i = 1; i < bytes; ++i) block.data()[i] = static_cast<char>(random());
  char* const p = block.data();
  p[0] = lead;
  const int32_t count = block.size();
  LXGetCharType(locale, p, LX_CTYPE1);
  const LXWChar code = LXGetChar(locale, p);
  LXGetCharTypeW(locale, code, LX_CTYPE2);
  must(LXPutChar(locale, out.data(), code) == 0, "a code is stored");
  must(LXNextChar(locale, p) <= p + bytes, "a character ends in its block");
  LXPrevChar(locale, p, p + bytes);
  LXValidChar(locale, p);
  LXCpStrByteToCharLen(codepage, p, LX_SHIFT_SINGLE, count);
  LXCpUnicodeToChar(codepage, static_cast<LXUChar>(random()), out.data());
  LXCpUnicodeToCharW(codepage, static_cast<LXUChar>(random()));
  LXCpMbToUnicodeW(codepage, code);
  LXCpMbToUnicodeW(codepage, static_cast<LXWChar>(random()));
  LXCpFullToHalfW(codepage, code);
  if (width == 1) return;
  LXCpMbToUnicode(codepage, p);
  LXGetMbCtype(codepage, p);
  LXGetMbCtypeW(codepage, code);
  LXCpMbCaseConv(codepage, p, out.data(), LX_C1_UPPER);
  LXCpMbCaseConvW(codepage, code, LX_C1_LOWER);
  LXCpMbHalfToFullW(codepage, code);
  if (bytes == width) LXCpMbCaseConvS(codepage, p, out.data(), LX_C1_LOWER);
}

/// The same behind a shift byte, if it is one, in both states.
void use_shifted(LXLocale* locale, const LXObject* codepage, unsigned first, Random& random, size_t width) {
  Exact<char> block(2 * width + 1), out(2 * kMostCharBytes);
  for (int32_t i = 1; i < block.size(); ++i) block.data()[i] = static_cast<char>(random());
  char* const p = block.data();
  p[0] = static_cast<char>(first);
  for (LXShiftState state : {LX_SHIFT_SINGLE, LX_SHIFT_DOUBLE}) {
    LXShiftState next = state;
    LXGetCharTypeEx(locale, p, state, LX_CTYPE3);
    LXPutCharEx(locale, out.data(), state, LXGetCharEx(locale, p, state));
    must(LXNextCharEx(locale, p, state, &next, 0) <= p + block.size(), "a character ends in its block");
    LXPrevCharEx(locale, p, p + width, state, &next);
    LXByteLengthEx(locale, p, state);
    LXValidCharEx(locale, p, state);
    LXCpStrCharToByteLen(codepage, p, state, 1);
  }
}

/// First bytes, a third of them a call, and Unicode values, an eighth of them, in one text there and back.
void use_codepage(LXLocale* locale, Random& random) {
  int32_t rc = LX_OK;
  const auto id = static_cast<uint16_t>(LXGetLocaleNumInfo(locale, LX_ITEM_CODEPAGE_ID, 0));
  const LXObject* codepage = LXGetObjFromID(nullptr, LX_CODEPAGE, id, LX_FIND_AND_LOAD, &rc);
  if (codepage == nullptr) return;
  const auto width = static_cast<size_t>(LXGetLocaleNumInfo(locale, LX_ITEM_CODEPAGE_WIDTH, 0));
  for (unsigned first = static_cast<unsigned>(random() % 3); first <= 0xFF; first += 3) {
    use_character(locale, codepage, first, random, width);
    use_shifted(locale, codepage, first, random, width);
  }
  static const Units all = [] {
    Units units;
    for (unsigned u = 0; u <= 0xFFFF; ++u) units.push_back(static_cast<LXUChar>(u));
    return units;
  }();
  constexpr size_t kPart = 0x2000;
  static char bytes[kPart * (kMostCharBytes + 1)];
  static LXUChar units[sizeof(bytes)];
  const LXUChar* const part = all.data() + random() % 8 * kPart;
  const int32_t count = LXUnicodeToStringEx(locale, bytes, LX_SHIFT_SINGLE, sizeof(bytes), part, kPart, 0);
  must(count >= 0 && count <= static_cast<int32_t>(sizeof(bytes)), "values become bytes");
  Exact<char> text(std::string(bytes, static_cast<size_t>(count)));
  must(LXStringToUnicodeEx(units, sizeof(bytes), locale, text.data(), LX_SHIFT_SINGLE, count, 0) <= count,
       "a character has a byte");
}

/// The weights and keys of all values, in pieces that begin anywhere.
void use_sort(LXLocale* locale, Random& random) {
  int32_t rc = LX_OK;
  const LXObject* sort = LXGetObjFromName(nullptr, LX_SORT, kSort, sizeof(kSort), LX_FIND_AND_LOAD, &rc);
  constexpr size_t kPiece = 64;
  Units piece(kPiece, 0);
  for (unsigned page = 0; page <= 0xFF; ++page) {
    // The values of the test's sort, and any of the page.
    static const Units known = lx::test::units("aAbchesSyz12-+");
    for (LXUChar& unit : piece)
      unit = random() % 3 == 0 ? known[random() % known.size()]
                               : static_cast<LXUChar>(page << 8 | (random() & 0xFF));
    const Exact<LXUChar> text(piece);
    Exact<uint8_t> key(random() % (8 * kPiece));
    for (uint32_t options : {0u, LX_CASE_INSENSITIVE}) {
      LXStrxfrmU(locale, key.data(), key.size(), text.data(), text.size(), options);
      LXStrcollU(locale, text.data(), 40, text.data() + 20, 44, options);
    }
    LXStrGenSortKey(locale, key.data(), key.size(), text.data(), text.size());
    uint16_t weights[4];
    uint8_t levels[5];
    for (size_t i = 0; sort != nullptr && i + 1 < kPiece; i += 7) {
      LXSortGetWeights(sort, piece[i], &weights[0], &levels[0], &levels[1], &weights[1], &weights[2],
                       &levels[2], &levels[3], &weights[3], &levels[4]);
      LXSortGetCombination(sort, piece[i], piece[i + 1], &weights[0], &levels[0], &levels[1], &weights[1],
                           &levels[2]);
    }
  }
}

/// Every message comes terminated, in both modes. The numbers to ask for are words of the file, and some that mostly
/// are none.
void use_catalog(LXLocale* locale, const ScratchDirectory& directory, const SmallFile& file) {
  const ByteString bytes = directory.read(file.name);
  std::vector<uint32_t> numbers = {0, 1, 2, UINT32_MAX};
  for (size_t at = lx::format::catalog::kHeaderBytes; at + 4 <= bytes.size() && numbers.size() < 14; at += 28)
    numbers.push_back(lx::le32(&bytes[at]));
  for (const uint32_t mode : {0u, uint32_t{LX_CATALOG_LOAD}}) {
    LXCatalog* catalog = LXOpenCatalog(locale, nullptr, directory.file(file.name).c_str(), mode);
    for (const uint32_t set : numbers)
      for (const uint32_t number : numbers) {
        if (catalog == nullptr) break;
        Exact<char> text(12);
        Exact<LXUChar> units(12);
        Exact<LXWChar> codes(12);
        const int32_t code = LXGetMessage(catalog, set, number, text.data(), text.size(), nullptr);
        must(code == LX_OK || code == LX_E_CATALOG || code == LX_E_MESSAGE, "a message is there or not");
        must(memchr(text.data(), 0, 12) != nullptr, "a message ends");
        must(LXGetMessageU(catalog, set, number, units.data(), units.size(), nullptr) == code &&
                 LXGetMessageW(catalog, set, number, codes.data(), codes.size(), nullptr) == code,
             "forms agree");
      }
    must(catalog == nullptr || LXCloseCatalog(catalog) == LX_OK, "a catalog closes");
  }
}

/// Everything the control file lists, by name, by identifier and by alias.
void use_objects() {
  LXEnumLocales([](void*, int32_t, const char* name) { return strlen(name) <= 33 ? 1 : 0; }, nullptr);
  LXEnumAliases(
      nullptr,
      [](void*, const char* codepage, const char* alias) {
        must(strlen(codepage) <= 32 && strlen(alias) <= 64, "names have their lengths");
        int32_t rc = LX_OK;
        LXGetObjFromName(nullptr, LX_CODEPAGE, codepage, static_cast<int32_t>(strlen(codepage)), LX_FIND_ONLY,
                         &rc);
        return 1;
      },
      nullptr);
  for (const char* alias : {"utf8", "ISO", "nothing"}) LXGetCodepageFromAlias(nullptr, alias);
  for (int32_t type = LX_LANGUAGE; type <= LX_SORT; ++type)
    for (int32_t id : {0, 1, 2, 5, 276, 367, 840, 9001, 57352, 0xFFFF}) {
      int32_t rc = LX_OK;
      LXGetObjFromID(nullptr, type, static_cast<uint16_t>(id), LX_FIND_AND_LOAD, &rc);
    }
}

void use_locales(const ScratchDirectory& directory, const std::vector<std::string>& codepages,
                 const SmallFile& file, Random& random) {
  if (file.use == Use::kLocale) use_objects();
  const std::string& codepage = file.codepage.empty() ? codepages[random() % codepages.size()] : file.codepage;
  const std::string& to = codepages[random() % codepages.size()];
  const auto get = [&](const std::string& of) {
    return LocalePtr(LXGetLocale((std::string(kLanguageAndTerritory) + "." + of + "@" + kSort).c_str(),
                                 random() % 8 == 0 ? LX_FALLBACK : 0, nullptr));
  };
  const LocalePtr locale = get(codepage), other = get(to);
  if (locale == nullptr) return;
  if (file.use == Use::kCatalog) return use_catalog(locale.get(), directory, file);
  use_texts(locale.get(), other != nullptr ? other.get() : locale.get(), random, file.use == Use::kLocale);
  if (file.use == Use::kCodepage) use_codepage(locale.get(), random);
  if (file.use == Use::kSort) use_sort(locale.get(), random);
}

}  // namespace

void use_directory(const ScratchDirectory& directory, const SmallFiles& files, const SmallFile& file,
                   uint32_t seed) {
  Random random(seed + 1);
  Blocks blocks;
  const int descriptor = next_descriptor();
  const uint32_t options = seed % 8 == 0 ? 0 : uint32_t{LX_NO_DEFAULTS};
  const int32_t code = LXInit(directory.path().c_str(), Blocks::allocate, Blocks::release, &blocks, options);
  must(code == LX_OK || code == LX_W_DEFAULTS, "the library is initialised");
  use_locales(directory, files.codepages(), file, random);
  must(LXTerm() == LX_OK, "the library ends");
  must(blocks.live == 0, "every block comes back");
  must(blocks.largest <= Blocks::kMost, "no block is larger than files ask for");
  must(next_descriptor() == descriptor, "every descriptor is closed");
}

}  // namespace mutate
