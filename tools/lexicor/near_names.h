// Names that are likely meant by a misspelt one.
#pragma once

#include <algorithm>
#include <string>
#include <vector>

namespace lexicor_cli {

inline char lower_ascii(char c) {
  return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
}

/// Levenshtein distance of two names, without regard to case.
inline size_t edit_distance(const std::string& a, const std::string& b) {
  std::vector<size_t> row(b.size() + 1);
  for (size_t j = 0; j <= b.size(); ++j) row[j] = j;
  for (size_t i = 1; i <= a.size(); ++i) {
    size_t diagonal = row[0];
    row[0] = i;
    for (size_t j = 1; j <= b.size(); ++j) {
      const size_t replaced = diagonal + (lower_ascii(a[i - 1]) != lower_ascii(b[j - 1]));
      diagonal = row[j];
      row[j] = std::min({replaced, row[j] + 1, row[j - 1] + 1});
    }
  }
  return row[b.size()];
}

/// Whether a name at this distance is worth naming.
inline bool is_near(const std::string& misspelt, const std::string& name, size_t distance) {
  return distance <= std::max<size_t>(2, misspelt.size() / 3) && distance < name.size();
}

/// The nearest of the names, the first of equally near ones; one that goes on where the misspelt name ends is
/// the nearest. Empty: none is near.
inline std::string nearest_name(const std::string& misspelt, const std::vector<std::string>& names) {
  constexpr size_t kLeastBeginning = 3;
  std::string nearest;
  size_t least = std::string::npos;
  for (const std::string& name : names) {
    const bool begins = misspelt.size() >= kLeastBeginning && name.compare(0, misspelt.size(), misspelt) == 0;
    const size_t distance = begins ? 0 : edit_distance(misspelt, name);
    if (distance >= least || !is_near(misspelt, name, distance)) continue;
    nearest = name;
    least = distance;
  }
  return nearest;
}

/// "; did you mean A, B or C?", or nothing.
inline std::string did_you_mean(const std::vector<std::string>& names) {
  std::string text;
  for (size_t i = 0; i < names.size(); ++i)
    text += (i == 0 ? "; did you mean " : i + 1 < names.size() ? ", " : " or ") + names[i];
  return text.empty() ? text : text + "?";
}
inline std::string did_you_mean(const std::string& name) {
  return name.empty() ? "" : did_you_mean(std::vector<std::string>{name});
}

}  // namespace lexicor_cli
