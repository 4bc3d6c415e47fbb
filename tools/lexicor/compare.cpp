// lexicor compare and lexicor key: which of two texts comes first, and the bytes by which a text is sorted.
#include <lx.h>

#include <memory>

#include "arguments.h"
#include "collation.h"
#include "command.h"
#include "hex.h"
#include "output.h"
#include "report.h"

namespace lexicor_cli {

namespace {

struct CompareOptions {
  std::string locale;  // empty: the user's
  std::string rules;   // a file; empty: the locale's sort
  bool ignore_case = false;
  bool ignore_width = false;
  bool json = false;
  std::string text1, text2;

  uint32_t options() const {
    return ignore_case ? LX_CASE_INSENSITIVE : ignore_width ? LX_WIDTH_INSENSITIVE : 0;
  }
};

int compare(const CompareOptions& options, const CommonOptions& common) {
  RulesSession session(common, options.rules);
  Collation collation(session, options.locale);
  collation.check_argument(options.text1);
  collation.check_argument(options.text2);
  const int32_t result = collation.compare(options.text1, options.text2, options.options());
  const char order = result == 0 ? '=' : result < 0 ? '<' : '>';
  Output().write(options.json
                     ? json_text({{"a", options.text1}, {"b", options.text2}, {"order", std::string(1, order)}})
                     : options.text1 + sign_text(result) + options.text2 + "\n");
  return result == 0 ? kDone : result < 0 ? kLess : kGreater;
}

/// Reads a key from its start: weights of two bytes, of which the first is never zero, and of one.
class KeyText {
 public:
  explicit KeyText(const std::string& key) : key_(key) {}

  std::string levels() {
    std::string text = "[" + level(2);
    const bool has_primaries = at_ > 1;
    const std::string secondaries = level(1);
    const std::string tertiaries = level(1);
    text += " |" + secondaries + " |" + tertiaries + " |";
    const bool has_positions = has_primaries || !secondaries.empty() || !tertiaries.empty();
    while (at_ < key_.size()) {
      text += " " + hex(2);
      if (has_positions) text += ":" + hex(2);
    }
    return text + "]";
  }

 private:
  /// The weights up to a zero byte, with a blank before each.
  std::string level(size_t weight_bytes) {
    std::string text;
    while (at_ < key_.size() && key_[at_] != 0) text += " " + hex(weight_bytes);
    ++at_;
    return text;
  }

  std::string hex(size_t bytes) {
    std::string text;
    for (; bytes > 0 && at_ < key_.size(); --bytes) text += hex_text(static_cast<uint8_t>(key_[at_++]), 2);
    return text;
  }

  const std::string& key_;
  size_t at_ = 0;
};

int show_key(const CompareOptions& options, const CommonOptions& common) {
  RulesSession session(common, options.rules);
  Collation collation(session, options.locale);
  collation.check_argument(options.text1);
  std::string key;
  collation.append_key(options.text1, options.options(), &key);
  Output().write(options.json ? json_text({{"text", options.text1}, {"key", hex_bytes(key)}})
                              : (collation.binary() ? hex_bytes(key) : KeyText(key).levels()) + "\n");
  return kDone;
}

void declare_order(Arguments& command, CompareOptions& options) {
  command.add_option("--locale", options.locale, "locale whose sort is used; else the user's locale")
      .type_name("LOCALE");
  add_rules_option(command, options.rules);
  const Arguments::Option ignore_case =
      command.add_flag("--case-insensitive", options.ignore_case, "letter case does not count");
  command
      .add_flag("--width-insensitive", options.ignore_width,
                "full-width and half-width forms are equal; case counts")
      .excludes(ignore_case);
  command.add_flag("--json", options.json, "print JSON");
}

}  // namespace

Run declare_compare(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<CompareOptions>();
  declare_order(command, *options);
  command.add_option("A", options->text1, "a text, in UTF-8").required().type_name("");
  command.add_option("B", options->text2, "another one").required().type_name("");
  command.footer(
      "Prints A < B, A = B or A > B, in the order of 'lexicor sort'. Exit codes: 0 equal, 3 A comes first, "
      "4 B comes\n"
      "first; 1 and 2 are errors.\n"
      "\n"
      "Examples:\n"
      "  lexicor compare --locale Swedish ö z\n"
      "  lexicor compare --case-insensitive --locale English@Default Zoo zoo");
  return [options, &common] { return compare(*options, common); };
}

Run declare_key(Arguments& command, const CommonOptions& common) {
  const auto options = std::make_shared<CompareOptions>();
  declare_order(command, *options);
  command.add_option("TEXT", options->text1, "a text, in UTF-8").required().type_name("");
  command.footer(
      "Prints the key's primary, secondary, tertiary and special weights in hexadecimal, each special one "
      "behind\n"
      "its character's position. A zero byte of the key reads as a bar. In binary order the key is the text "
      "itself.\n"
      "JSON has the bytes of the key.\n"
      "\n"
      "Examples:\n"
      "  lexicor key --locale Czech@Czech chata\n"
      "  lexicor key --locale English@Default co-op");
  return [options, &common] { return show_key(*options, common); };
}

}  // namespace lexicor_cli
