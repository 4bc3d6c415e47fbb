// An order that the user has written as collation rules: a private locale directory with the rules as a further
// sort, compiled by the library of lexicor-data.
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "lexicor-data/rules_directory.h"
#include "session.h"

namespace lexicor_cli {

class Arguments;

/// Adds --rules to a command that orders texts.
void add_rules_option(Arguments& command, std::string& file);

/// A session whose locale directory has the sort of a file of rules. Without a file it is a plain one.
class RulesSession {
 public:
  /// Throws a Failure; of a fault in the rules it says the place.
  RulesSession(const CommonOptions& common, const std::string& rules_file);

  operator const Session&() const { return *session_; }
  /// The sort of the rules; none: that of the locale.
  std::optional<uint16_t> sort_id() const { return sort_id_; }
  /// Removes the directory, once everything is loaded: what is interrupted later leaves nothing.
  void discard_directory() { directory_.reset(); }

 private:
  std::unique_ptr<const lexicor_data::RulesDirectory> directory_;
  std::optional<uint16_t> sort_id_;
  std::unique_ptr<const Session> session_;
};

}  // namespace lexicor_cli
