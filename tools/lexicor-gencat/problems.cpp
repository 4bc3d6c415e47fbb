// Messages in the form of compilers: file, line, column.
#include "problems.h"

#include <algorithm>

namespace lexicor_gencat {

std::string place_text(const Place& place) {
  return place.file + ":" + std::to_string(place.line) + ":" + std::to_string(place.column);
}

void Problems::error(const Place& place, const std::string& text) {
  ++errors_;
  add(place, true, "error: " + text);
}

void Problems::warning(const Place& place, const std::string& text) {
  if (warnings_) add(place, false, "warning: " + text);
}

void Problems::add(const Place& place, bool error, const std::string& text) {
  if (files_.empty() || files_.back().name != place.file) files_.push_back({place.file, {}, 0});
  File& file = files_.back();
  if (file.listed.size() == kListed) {
    ++file.unlisted;
    const auto warning = std::find_if(file.listed.rbegin(), file.listed.rend(),
                                      [](const Message& message) { return !message.error; });
    if (!error || warning == file.listed.rend()) return;
    file.listed.erase(std::next(warning).base());
  }
  file.listed.push_back({error, place_text(place) + ": " + text});
}

std::vector<std::string> Problems::lines() const {
  std::vector<std::string> lines;
  for (const File& file : files_) {
    for (const Message& message : file.listed) lines.push_back(message.line);
    if (file.unlisted > 0) lines.push_back(file.name + ": and " + std::to_string(file.unlisted) + " more");
  }
  return lines;
}

}  // namespace lexicor_gencat
