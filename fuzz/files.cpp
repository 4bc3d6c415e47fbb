#include "files.h"

#include "support/sort_builder.h"

namespace lx::fuzz {
namespace {

const ScratchDirectory& scratch() {
  static const ScratchDirectory directory;
  return directory;
}
ByteString small_sort() {
  SortBuilder sort;
  for (LXUChar letter = 'a'; letter <= 'z'; ++letter) sort.characters[letter].weights = {letter, 1, 1, 0};
  sort.pairs.push_back({'c', 'h', {{'c' + 1, 2, 1, 0}, 11}});
  return sort.payload();
}

void write_whole_directory() {
  scratch().write_locale(
      {{367, "US-ASCII", ascii_codepage()}, {819, "Fuzz", ascii_codepage()}, {57352, "UTF-8", {ByteString(1)}}},
      {{{1, LX_SORT, "Default"}, small_sort()}});
  scratch().write("alias.txt", {});
}

}  // namespace

FileLibrary::FileLibrary(const std::string& file, const Input& content, const std::string& codepage)
    : directory_(scratch()) {
  static std::string damaged;
  if (damaged != file) write_whole_directory();
  damaged = file;
  directory_.write(file, {content.data(), content.data() + content.left()});
  must(LXInit(directory_.path().c_str(), nullptr, nullptr, nullptr, 0) != LX_E_NOT_INITIALIZED,
       "the library runs");
  locale_ = LXGetLocale(("English_UnitedStates." + codepage + "@Default").c_str(), LX_FALLBACK, nullptr);
}

FileLibrary::~FileLibrary() {
  LXReleaseLocale(locale_);
  must(LXTerm() == LX_OK, "all is given back");
}

void use_items(LXLocale* locale) {
  constexpr size_t kRoom = 128;
  in_all_forms([&](const auto& form) {
    using Unit = typename std::decay_t<decltype(form)>::Unit;
    states = {};
    for (int32_t number = 0; number <= LX_ITEM_LOCALE_STRING + 1; ++number)
      for (const int32_t flags : {0, int32_t{LX_TERRITORY_VALUES}}) {
        LXGetLocaleNumInfo(locale, number, flags);
        const auto text = written<Unit>(
            [&](Unit* to, int32_t size) { return form.get_item(locale, number, to, size, flags); }, kRoom);
        must(text.empty() || text.back() == 0, "a text is terminated");
      }
    for (const double value : {-1234567890.0, -1.5e300, 0.5})
      for (const Value::Kind kind : {Value::kLong, Value::kDouble, Value::kAmount})
        for (const uint32_t flags : {0u, uint32_t{LX_INTERNATIONAL}})
          if (kind != Value::kLong || value == -1234567890.0)
            written<Unit>(
                [&](Unit* to, int32_t size) {
                  return write(form, locale, Value{kind, value, kind == Value::kAmount ? flags : 0}, to, size,
                               LX_TERMINATE);
                },
                kRoom);
    const LXTime time{9, 5, 14, 21, 10, 126, 6, 324};
    for (const char* const by : {"%x", "%#x", "%X", "%c", "%A %B %p", "%a %b"}) {
      const auto format = encode(form, locale, units(by));
      const Block<Unit> text(write(form, locale, time, format));
      LXTime read = time;
      form.read_time(locale, &read, text.data(), text.size(), format.data(), count_of(format), 0u);
    }
  });
}

}  // namespace lx::fuzz
