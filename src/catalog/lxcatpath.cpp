// Where a catalog is looked for: a list of path templates, expanded for one locale and then for the default
// one.
#include "catalog/lxmsgcat.h"
#include "codepage/lxtext.h"
#include "core/lxfile.h"
#include "locale/lxlocale.h"

using namespace lx;

namespace {

constexpr char kSearchVariable[] = "LX_NLSPATH";
constexpr int32_t kSearchVariableBytes = 28;  // with the null
constexpr int32_t kAbbreviationBytes = 32;    // with the null
constexpr char kListEnd = ';';

/// A path as it is made, in LX_CATALOG_PATH_BYTES bytes. One that does not fit is no path.
class Path {
 public:
  explicit Path(char* buffer) : buffer_(buffer) {}

  void add(const char* text, size_t bytes) {
    fits_ = fits_ && bytes < LX_CATALOG_PATH_BYTES - used_;
    if (!fits_) return;
    memcpy(buffer_ + used_, text, bytes);
    used_ += bytes;
  }
  void add(const char* text) { add(text, strlen(text)); }

  /// Opens the file, if the path is one, and begins the next path.
  LXFile* open() {
    const bool is_path = fits_ && used_ != 0;
    buffer_[used_] = 0;
    used_ = 0;
    fits_ = true;
    int32_t rc = LX_OK;
    return is_path ? open_for_reading(buffer_, &rc) : nullptr;
  }

 private:
  char* buffer_;
  size_t used_ = 0;
  bool fits_ = true;
};

/// What directives stand for.
struct Values {
  const char* name;
  char language[kAbbreviationBytes] = "";
  char territory[kAbbreviationBytes] = "";

  Values(LXLocale* locale, const char* name_given) : name(name_given) {
    LXGetLocaleTextInfo(locale, LX_ITEM_LANGUAGE_ABBREVIATION, language, sizeof(language), 0);
    LXGetLocaleTextInfo(locale, LX_ITEM_TERRITORY_ABBREVIATION, territory, sizeof(territory), 0);
  }
};

/// Adds the value of a directive; false when there is no such one.
bool add_value(LXWChar letter, const Values& values, Path* path) {
  switch (letter) {
    case 'N':
      path->add(values.name);
      return true;
    case 'l':
      path->add(values.language);
      return true;
    case 't':
      path->add(values.territory);
      return true;
    case 'L':
      path->add(values.language);
      path->add("_");
      path->add(values.territory);
      return true;
    case '%':
      path->add("%");
      return true;
    default:
      return false;
  }
}

/// Opens the first path of a list of templates that can be opened.
template <class Cursor>
LXFile* open_first(Cursor in, const Values& values, Path path) {
  LXWChar code = 0;
  for (const uint8_t* start = in.p; in.next(&code); start = in.p) {
    if (code == kListEnd) {
      if (LXFile* file = path.open()) return file;
      continue;
    }
    if (code == '%' && in.next(&code) && add_value(code, values, &path)) continue;
    path.add(reinterpret_cast<const char*>(start), static_cast<size_t>(in.p - start));
  }
  return nullptr;
}

/// The search list, and room for one path.
struct Search {
  const char* list;
  size_t list_bytes;
  const char* name;
  char* path;

  LXFile* run(LXLocale* locale) const {
    const Values values(locale, name);
    return with_cursor(codepage_of(*locale->codepage), Form::kPlain, LX_SHIFT_SINGLE, bytes_of(list),
                       list_bytes, [&](const auto& in) { return open_first(in, values, Path(path)); });
  }
};

char* add_element(char* end, const char* text) {
  const size_t bytes = strlen(text);
  memcpy(end, text, bytes);
  end[bytes] = kListEnd;
  return end + bytes + 1;
}

}  // namespace

namespace lx {

LXFile* open_catalog_file(LXLocale* locale, const char* directory, const char* name, bool one_locale,
                          int32_t* rc) {
  char variable[kSearchVariableBytes];
  const int32_t variable_bytes = LXGetEnv(kSearchVariable, variable, sizeof(variable));
  const bool has_variable = variable_bytes > 0 && variable_bytes <= kSearchVariableBytes;
  if (directory == nullptr) directory = "";
  const uint64_t bytes =
      uint64_t{LX_CATALOG_PATH_BYTES} + strlen(directory) + 1 + kSearchVariableBytes + strlen(name) + 1;
  *rc = LX_E_MEMORY;
  const HookPtr<char> block(
      static_cast<char*>(bytes <= INT32_MAX ? hook_allocate(static_cast<size_t>(bytes)) : nullptr));
  if (!block) return nullptr;
  char* const list = block.get() + LX_CATALOG_PATH_BYTES;
  char* end = list;
  if (directory[0] != 0) end = add_element(end, directory);
  if (has_variable) end = add_element(end, variable);
  end = add_element(end, name);

  const Search search{list, static_cast<size_t>(end - list), name, block.get()};
  *rc = LX_E_CATALOG;
  LXFile* file = search.run(locale);
  if (file != nullptr || one_locale) return file;
  LXLocale* fallback = LXGetLocale("", LX_FALLBACK, nullptr);
  if (fallback == nullptr) return nullptr;
  file = search.run(fallback);
  free_locale(fallback);
  return file;
}

}  // namespace lx
