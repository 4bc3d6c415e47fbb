#include "rules.h"

#include <stdexcept>

#include "arguments.h"

namespace lexicor_cli {

void add_rules_option(Arguments& command, std::string& file) {
  command.add_option("--rules", file, "collation rules of your own, instead of the locale's sort")
      .not_empty()
      .type_name("FILE");
}

RulesSession::RulesSession(const CommonOptions& common, const std::string& rules_file)
    : session_(std::make_unique<const Session>(common)) {
  if (rules_file.empty()) return;
  if (rules_file == "-") throw Failure(kUsageError, "--rules takes a file, not standard input");
  if (session_->built_in_only()) throw Failure(kDataError, "--rules needs a locale directory");
  const std::string base = locale_directory();
  session_.reset();
  try {
    directory_ = std::make_unique<const lexicor_data::RulesDirectory>(base, rules_file);
  } catch (const std::runtime_error& error) {
    throw Failure(kDataError, error.what());
  }
  sort_id_ = directory_->sort_id();
  CommonOptions own = common;
  own.locale_dir = directory_->path();
  session_ = std::make_unique<const Session>(own);
}

}  // namespace lexicor_cli
