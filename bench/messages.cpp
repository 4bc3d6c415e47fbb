// Messages of a catalog beside catgets and a resource bundle of ICU, with the same texts in all three. They are
// fetched in random order.
#include <nl_types.h>

#include <algorithm>
#include <cstring>
#include <numeric>
#include <random>

#include "codepages.h"
#include "families.h"
#include "icu.h"
#include "keep.h"

namespace bench {
namespace {

constexpr int kMessages = 500;  // numbered from 1 on, in set 1

std::vector<int> shuffled_numbers() {
  std::vector<int> numbers(kMessages);
  std::iota(numbers.begin(), numbers.end(), 1);
  std::shuffle(numbers.begin(), numbers.end(), std::mt19937(1));
  return numbers;
}

class MessageRows {
 public:
  MessageRows(Table* table, const Texts& texts)
      : table_(*table),
        path_(texts.path("messages.lxcat")),
        bundles_(texts.path("messages")),
        system_(catopen(texts.path("messages.cat").c_str(), 0), close_system) {}

  void add() {
    add_row("message/loaded/UTF-8", ours("English.UTF-8", LX_CATALOG_LOAD),
            {{"catgets in place", system_in_place(), false},
             {"catgets", system_copied()},
             {kIcu, icu::messages(bundles_, find_encoding("UTF-8"), numbers_)}});
    add_row("message/loaded/Latin1", ours("English.Latin1", LX_CATALOG_LOAD),
            {{kIcu, icu::messages(bundles_, find_encoding("Latin1"), numbers_)}});
    add_row("message/loaded/UTF-16", ours_utf16(),
            {{kIcu, icu::messages(bundles_, find_encoding("UTF-16"), numbers_)}});
    add_row("message/file/UTF-8", ours("English.UTF-8", 0), {{"catgets", system_copied()}});
  }

 private:
  static void close_system(nl_catd catalog) {
    if (catalog != reinterpret_cast<nl_catd>(-1)) catclose(catalog);
  }

  /// `peers` lack the library itself.
  void add_row(const char* name, Work ours, std::vector<Peer> peers) {
    if (!ours) return;
    peers.insert(peers.begin(), {kOurs, std::move(ours)});
    table_.add({name, std::move(peers), numbers_.size(), numbers_.size(), numbers_.size() * kMessageRoom});
  }

  Work ours(const char* locale_name, uint32_t flags) const {
    const LocalePointer locale = open_locale(locale_name);
    const std::shared_ptr<LXCatalog> catalog(LXOpenCatalog(locale.get(), nullptr, path_.c_str(), flags),
                                             LXCloseCatalog);
    if (catalog == nullptr)
      return std::fprintf(stderr, "no catalog %s; its rows are left out\n", path_.c_str()), nullptr;
    return message_work(numbers_, [locale, catalog](int number, char* out) {
      LXGetMessage(catalog.get(), 1, static_cast<uint32_t>(number), out, kMessageRoom, nullptr);
    });
  }

  Work ours_utf16() const {
    const LocalePointer locale = open_locale("English.UTF-8");
    const std::shared_ptr<LXCatalog> catalog(
        LXOpenCatalog(locale.get(), nullptr, path_.c_str(), LX_CATALOG_LOAD), LXCloseCatalog);
    if (catalog == nullptr) return nullptr;
    return message_work(numbers_, [locale, catalog](int number, char* out) {
      LXGetMessageU(catalog.get(), 1, static_cast<uint32_t>(number), reinterpret_cast<LXUChar*>(out),
                    kMessageRoom / 2, nullptr);
    });
  }

  /// Its text may be used where it stands.
  Work system_in_place() const {
    return message_work(numbers_,
                        [system = system_](int number, char*) { keep(catgets(system.get(), 1, number, "")); });
  }
  Work system_copied() const {
    return message_work(numbers_, [system = system_](int number, char* out) {
      strcpy(out, catgets(system.get(), 1, number, ""));
    });
  }

  Table& table_;
  const std::string path_, bundles_;
  const std::shared_ptr<void> system_;
  const std::vector<int> numbers_ = shuffled_numbers();
};

}  // namespace

void add_message_rows(Table* table, Texts* texts) {
  if (table->wants_some("message/")) MessageRows(table, *texts).add();
}

}  // namespace bench
