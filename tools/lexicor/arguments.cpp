// Hands declarations on to the argument parser.
#include "arguments.h"

#include <CLI/CLI.hpp>
#include <limits>

namespace lexicor_cli {

using Option = Arguments::Option;

const Option& Option::required() const {
  option_->required();
  return *this;
}
const Option& Option::type_name(const char* name) const {
  option_->type_name(name);
  return *this;
}
const Option& Option::one_of(const std::vector<std::string>& values) const {
  option_->check(CLI::IsMember(values));
  return *this;
}
const Option& Option::at_least(int32_t least) const {
  option_->check(CLI::Range(least, std::numeric_limits<int32_t>::max()));
  return *this;
}
const Option& Option::divided_by(char delimiter) const {
  option_->delimiter(delimiter)->allow_extra_args(false);
  return *this;
}
const Option& Option::needs(const Option& other) const {
  option_->needs(other.option_);
  return *this;
}
const Option& Option::excludes(const Option& other) const {
  option_->excludes(other.option_);
  return *this;
}

Option Arguments::add_option(const char* name, std::string& value, const char* help) {
  return Option(command_.add_option(name, value, help));
}
Option Arguments::add_option(const char* name, std::optional<std::string>& value, const char* help) {
  return Option(command_.add_option(name, value, help));
}
Option Arguments::add_option(const char* name, std::vector<std::string>& values, const char* help) {
  return Option(command_.add_option(name, values, help));
}
Option Arguments::add_option(const char* name, int32_t& value, const char* help) {
  return Option(command_.add_option(name, value, help));
}
Option Arguments::add_option(const char* name, uint32_t& value, const char* help) {
  return Option(command_.add_option(name, value, help));
}
Option Arguments::add_flag(const char* name, bool& value, const char* help) {
  return Option(command_.add_flag(name, value, help));
}
Option Arguments::add_flag(const char* name, std::string& value, const std::vector<std::string>& values,
                           const char* help) {
  CLI::Option* const flag = command_.add_flag(std::string(name) + "{" + values[0] + "}", value, help);
  flag->check(CLI::IsMember(values));
  return Option(flag);
}

void Arguments::footer(const char* text) {
  command_.footer(text);
}

}  // namespace lexicor_cli
