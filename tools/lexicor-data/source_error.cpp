// Errors in sources, one by one and together.
#include "source_error.h"

#include <algorithm>
#include <tuple>

namespace lexicor_data {
namespace {

std::string located(const std::string& file, int line, int column, const std::string& what) {
  std::string text = file;
  if (line > 0) text += ":" + std::to_string(line);
  if (line > 0 && column > 0) text += ":" + std::to_string(column);
  return text + ": " + what;
}

}  // namespace

SourceError::SourceError(std::string file_name, int line_number, int column_number, const std::string& what)
    : std::runtime_error(located(file_name, line_number, column_number, what)),
      file(std::move(file_name)),
      line(line_number),
      column(column_number),
      fault(what) {}

std::vector<SourceError> SourceError::all() const {
  std::vector<SourceError> list{*this};
  list[0].further.clear();
  list.insert(list.end(), further.begin(), further.end());
  return list;
}

/// The same fault of a file that several sources are based on is one.
void SourceErrors::add(const SourceError& error) {
  for (const SourceError& entry : error.all()) {
    const auto same = [&](const SourceError& other) { return std::string(other.what()) == entry.what(); };
    if (std::none_of(list_.begin(), list_.end(), same)) list_.push_back(entry);
  }
}

void SourceErrors::add_all(const SourceErrors& errors) {
  for (const SourceError& error : errors.list_) add(error);
}

void SourceErrors::sort(const std::string& file) {
  const auto place = [&](const SourceError& error) {
    return std::make_tuple(error.file != file, error.line, error.column);
  };
  std::stable_sort(list_.begin(), list_.end(),
                   [&](const SourceError& a, const SourceError& b) { return place(a) < place(b); });
}

void SourceErrors::throw_if_any() const {
  if (list_.empty()) return;
  SourceError first = list_.front();
  first.further.assign(list_.begin() + 1, list_.end());
  throw first;
}

}  // namespace lexicor_data
