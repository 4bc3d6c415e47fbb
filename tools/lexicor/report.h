// What the subcommands that answer questions print with: columns of text, and JSON.
#pragma once

#include <nlohmann/json.hpp>
#include <string>

namespace lexicor_cli {

using Json = nlohmann::ordered_json;

enum class Align { kLeft, kRight };

/// The text filled up with blanks.
inline std::string padded(const std::string& text, size_t chars, Align align = Align::kLeft) {
  const std::string fill(text.size() < chars ? chars - text.size() : 0, ' ');
  return align == Align::kRight ? fill + text : text + fill;
}

/// Bytes that are no UTF-8 become U+FFFD.
inline std::string json_text(const Json& json) {
  return json.dump(2, ' ', false, Json::error_handler_t::replace) + "\n";
}

}  // namespace lexicor_cli
