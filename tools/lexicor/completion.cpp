// The words before the last one say the subcommand, and whether an option waits for its value.
#include "completion.h"

#include <lx.h>

#include <CLI/CLI.hpp>

#include "catalogue.h"
#include "near_names.h"
#include "notices.h"
#include "session.h"

namespace lexicor_cli {
namespace {

using Words = std::vector<std::string>;

bool begins_with(const std::string& word, const std::string& beginning) {
  return word.size() >= beginning.size() &&
         std::equal(beginning.begin(), beginning.end(), word.begin(),
                    [](char a, char b) { return lower_ascii(a) == lower_ascii(b); });
}

Words object_names(int type) {
  Words names;
  for (const CatalogueObject& object : read_catalogue().objects) {
    if (object.type == type) names.push_back(object.name);
  }
  return names;
}

/// The part of a locale's name that is being written, behind what is written of it.
Words locale_names(const std::string& word) {
  constexpr struct {
    const char* marks;  // one of these stands before the part
    int type;
  } kParts[] = {{"@", LX_SORT}, {".", LX_CODEPAGE}, {"_", LX_TERRITORY}, {"", LX_LANGUAGE}};
  for (const auto& part : kParts) {
    const size_t mark = word.find_last_of(part.marks);
    if (mark == std::string::npos && *part.marks != 0) continue;
    Words names = object_names(part.type);
    if (*part.marks != 0) {
      for (std::string& name : names) name.insert(0, word, 0, mark + 1);
    }
    return names;
  }
  return {};
}

Words native_names() {
  Words names;
  LXEnumNativeLocales(
      [](void* user, const char* native, const char*) {
        static_cast<Words*>(user)->emplace_back(native);
        return int32_t{1};
      },
      &names);
  return names;
}

/// "KIND:{lf,crlf}": the values that an option takes, if it takes some only.
Words listed_values(const std::string& type_name) {
  Words values;
  const size_t begin = type_name.find('{'), end = type_name.find('}');
  if (begin == std::string::npos || end == std::string::npos) return values;
  std::stringstream list(type_name.substr(begin + 1, end - begin - 1));
  for (std::string value; std::getline(list, value, ',');) values.push_back(value);
  return values;
}

class CommandWords {
 public:
  CommandWords(const CLI::App& program, const Words& words) : app_(&program) {
    for (size_t i = 0; i + 1 < words.size(); ++i) take(words[i]);
    last_ = words.empty() ? "" : words.back();
  }

  Words possible() {
    const size_t equals = last_.find('=');
    std::string done;  // stays before each candidate
    if (waiting_ == nullptr && last_.compare(0, 2, "--") == 0 && equals != std::string::npos) {
      waiting_ = option(last_.substr(0, equals));
      done = last_.substr(0, equals + 1);
    }
    const std::string word = last_.substr(done.size());
    Words candidates = waiting_ != nullptr                  ? values(*waiting_, word)
                       : !word.empty() && word[0] == '-'    ? options()
                       : !app_->get_subcommands({}).empty() ? subcommands()
                       : positional_ < positionals().size() ? values(*positionals()[positional_], word)
                                                            : Words();
    Words kept;
    for (const std::string& candidate : candidates) {
      if (begins_with(candidate, word)) kept.push_back(done + candidate);
    }
    return kept;
  }

 private:
  void take(const std::string& word) {
    if (waiting_ != nullptr) {
      if (waiting_->check_lname("locale-dir")) common_.locale_dir = word;
      waiting_ = nullptr;
    } else if (word.size() > 1 && word[0] == '-') {
      const CLI::Option* const named = option(word);
      if (named != nullptr && named->get_items_expected_max() > 0) waiting_ = named;
    } else if (!app_->get_subcommands({}).empty()) {
      for (const CLI::App* below : app_->get_subcommands({})) {
        if (below->get_name() == word) app_ = below;
      }
    } else if (positional_ + 1 < positionals().size()) {
      ++positional_;
    }
  }

  /// Of the subcommand, or of the program.
  const CLI::Option* option(const std::string& name) const {
    for (const CLI::App* app = app_; app != nullptr; app = app->get_parent()) {
      if (const CLI::Option* const found = app->get_option_no_throw(name)) return found;
    }
    return nullptr;
  }

  std::vector<const CLI::Option*> positionals() const {
    std::vector<const CLI::Option*> found;
    for (const CLI::Option* each : app_->get_options()) {
      if (each->get_positional()) found.push_back(each);
    }
    return found;
  }

  Words options() const {
    Words names;
    for (const CLI::App* app = app_; app != nullptr; app = app->get_parent()) {
      for (const CLI::Option* each : app->get_options()) {
        for (const std::string& name : each->get_lnames()) names.push_back("--" + name);
      }
    }
    return names;
  }

  Words subcommands() const {
    Words names;
    for (const CLI::App* below : app_->get_subcommands({})) names.push_back(below->get_name());
    return names;
  }

  Words values(const CLI::Option& wanted, const std::string& word) const {
    const std::string type = wanted.get_type_name();
    const std::string kind = wanted.get_positional() ? wanted.get_name() : type;
    Words words = listed_values(type);
    if (wanted.get_delimiter() != 0) {
      const std::string done = word.substr(0, word.find_last_of(wanted.get_delimiter()) + 1);
      for (std::string& each : words) each.insert(0, done);
    }
    if (!words.empty()) return words;
    const Session session(common_);
    if (kind == "CP" || kind == "CODEPAGE") return object_names(LX_CODEPAGE);
    if (kind == "LOCALE") return locale_names(word);
    if (kind == "NAME") return native_names();
    return {};
  }

  const CLI::App* app_;
  const CLI::Option* waiting_ = nullptr;  // for its value
  size_t positional_ = 0;                 // the one that comes next, or the last
  CommonOptions common_;
  std::string last_;
};

}  // namespace

std::vector<std::string> completions(const CLI::App& program, const std::vector<std::string>& words) {
  g_quiet = true;
  return CommandWords(program, words).possible();
}

}  // namespace lexicor_cli
