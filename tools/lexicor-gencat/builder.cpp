// Numbers of symbolic names are the next free ones behind those that the sources use; a number that is given
// later moves a name that has it to the next free one.
#include "builder.h"

#include <algorithm>

#include "lexicor/hex.h"

namespace lexicor_gencat {

void Recoder::put(TextWriter& text, const Character& character, const Place& place, Problems& problems) const {
  if (character.unicode == Character::kNone) {
    problems.error(place, bytes_name(character) + ": no character of " + source_.codepage().name() +
                              "; expected text in this codepage (--source-encoding names another)");
  } else if (!same_) {
    put_unicode(text, character.unicode, place, problems);
  } else {
    if (character.unicode > 0xFFFF)
      problems.warning(place, lexicor_cli::code_point_name(character.unicode) +
                                  " has no 16-bit Unicode value: programs that fetch it get U+FFFD");
    text.put(character.code);
  }
}

void Recoder::put_unicode(TextWriter& text, uint32_t unicode, const Place& place, Problems& problems) const {
  const std::optional<LXWChar> code = target_.find(unicode);
  if (code.has_value())
    text.put(*code);
  else
    problems.error(place, lexicor_cli::code_point_name(unicode) + ": no such character in " +
                              target_.codepage().name() + ", the codepage of the catalog");
}

CatalogBuilder::CatalogBuilder(Catalog existing, Problems& problems)
    : problems_(problems), catalog_(std::move(existing)) {
  for (auto& [number, messages] : catalog_.sets) {
    Set& set = sets_[number];
    for (auto& [message, text] : messages) set.messages[message].text = std::move(text);
  }
  catalog_.sets.clear();
}

void CatalogBuilder::begin_source() {
  current_ = kDefaultSet;
  for (auto& [number, set] : sets_) {
    set.named = false;
    for (auto& [message, entry] : set.messages) entry.place = {};
  }
}

void CatalogBuilder::select_set(uint32_t number) {
  current_ = number;
  last_set_ = std::max(last_set_, number);
}

void CatalogBuilder::select_named_set(const std::string& name, const Place& place) {
  for (auto& [number, set] : sets_) {
    if (set.name != name) continue;
    if (set.named)
      problems_.error(place, "set " + name + " is defined already, at " + place_text(set.name_place));
    set.named = true;
    set.name_place = place;
    current_ = number;
    return;
  }
  if (last_set_ == UINT32_MAX) {
    problems_.error(place, "no number is left for the set " + name);
    return;
  }
  select_set(last_set_ + 1);
  current().name = name;
  current().name_place = place;
  current().named = true;
}

void CatalogBuilder::delete_set(uint32_t number) {
  const auto found = sets_.find(number);
  if (found == sets_.end()) return;
  found->second.messages.clear();
  found->second.numbers.clear();
  found->second.last = 0;
}

void CatalogBuilder::delete_named_set(const std::string& name, const Place& place) {
  for (const auto& [number, set] : sets_) {
    if (set.name == name) return delete_set(number);
  }
  problems_.error(place, "unknown set " + name + "; expected a number, or a name that $set gave");
}

void CatalogBuilder::store(Set& set, uint32_t number, Message message) {
  if (!message.name.empty()) set.numbers[message.name] = number;
  set.messages[number] = std::move(message);
  set.last = std::max(set.last, number);
}

void CatalogBuilder::put(uint32_t number, std::string text, const Place& place) {
  Set& set = current();
  const auto found = set.messages.find(number);
  if (found != set.messages.end() && !found->second.name.empty()) {
    if (set.last == UINT32_MAX)
      problems_.error(place, "no number is left for " + found->second.name + ", which has this one");
    else
      store(set, set.last + 1, std::move(found->second));
  } else if (found != set.messages.end() && found->second.place.line != 0) {
    problems_.error(place, "message " + std::to_string(number) + " is defined already, at " +
                               place_text(found->second.place));
    return;
  }
  store(set, number, {std::move(text), place, "", {}});
}

void CatalogBuilder::put_named(const std::string& name, std::string text, const Place& place) {
  Set& set = current();
  const auto found = set.numbers.find(name);
  if (found != set.numbers.end()) {
    Message& message = set.messages[found->second];
    if (message.place.line != 0)
      problems_.error(place, "message " + name + " is defined already, at " + place_text(message.name_place));
    else
      message = {std::move(text), place, name, place};
    return;
  }
  if (set.last == UINT32_MAX)
    problems_.error(place, "no number is left for " + name);
  else
    store(set, set.last + 1, {std::move(text), place, name, place});
}

void CatalogBuilder::remove(uint32_t number) {
  Set& set = current();
  const auto found = set.messages.find(number);
  if (found == set.messages.end()) return;
  set.numbers.erase(found->second.name);
  set.messages.erase(found);
}

Catalog CatalogBuilder::take() {
  for (auto& [number, set] : sets_) {
    for (auto& [message, entry] : set.messages) catalog_.sets[number][message] = std::move(entry.text);
  }
  return std::move(catalog_);
}

std::vector<Symbol> CatalogBuilder::symbols() const {
  std::vector<Symbol> symbols;
  for (const auto& [number, set] : sets_) {
    const std::string prefix = set.name.empty() ? "AutomaticSet" + std::to_string(number) : set.name;
    if (!set.name.empty()) symbols.push_back({set.name + "Set", number, set.name_place});
    for (const auto& [message, entry] : set.messages) {
      if (!entry.name.empty()) symbols.push_back({prefix + entry.name, message, entry.name_place});
    }
  }
  return symbols;
}

}  // namespace lexicor_gencat
