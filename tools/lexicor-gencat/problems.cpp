// Messages in the form of compilers: file, line, column.
#include "problems.h"

namespace lexicor_gencat {

std::string place_text(const Place& place) {
  return place.file + ":" + std::to_string(place.line) + ":" + std::to_string(place.column);
}

void Problems::error(const Place& place, const std::string& text) {
  ++errors_;
  add(place, "error: " + text);
}

void Problems::warning(const Place& place, const std::string& text) {
  if (warnings_) add(place, "warning: " + text);
}

void Problems::add(const Place& place, const std::string& text) {
  if (files_.empty() || files_.back().name != place.file) files_.push_back({place.file, {}, 0});
  File& file = files_.back();
  if (file.listed.size() < kListed)
    file.listed.push_back(place_text(place) + ": " + text);
  else
    ++file.unlisted;
}

std::vector<std::string> Problems::lines() const {
  std::vector<std::string> lines;
  for (const File& file : files_) {
    lines.insert(lines.end(), file.listed.begin(), file.listed.end());
    if (file.unlisted > 0) lines.push_back(file.name + ": and " + std::to_string(file.unlisted) + " more");
  }
  return lines;
}

}  // namespace lexicor_gencat
