// A build without ICU and libunistring: the peers of libc are all there are.
#include "icu.h"

namespace bench::icu {

std::string versions() {
  return "";
}

bool reads_and_writes(const Encoding&, const std::string&, char16_t) {
  return true;
}

Work convert(const Input&, const Encoding&, const Encoding&) {
  return nullptr;
}
Work convert_utf(const Input&, const Encoding&, const Encoding&) {
  return nullptr;
}
Work map(const Input&, const Encoding&, const char*, bool) {
  return nullptr;
}
Work count_chars(const Input&, const Encoding&) {
  return nullptr;
}
Work walk(const Input&, const Encoding&) {
  return nullptr;
}
Work order_utf16(Order, const Words&, const char*) {
  return nullptr;
}
Work order_utf8(Order, const Words&, const char*) {
  return nullptr;
}
Work keys(const Words&, const char*) {
  return nullptr;
}
Work order_caseless(const Words&) {
  return nullptr;
}
Work find(const std::shared_ptr<const std::u16string>&) {
  return nullptr;
}
Work messages(const std::string&, const Encoding*, const std::vector<int>&) {
  return nullptr;
}
std::function<bool()> first_use(const char*, const char*, double) {
  return nullptr;
}
Writer<int32_t> integer_writer(const char*) {
  return nullptr;
}
Writer<double> double_writer(const char*) {
  return nullptr;
}
Writer<double> currency_writer(const char*) {
  return nullptr;
}
Writer<double> time_writer(const char*, const char16_t*) {
  return nullptr;
}
Reader<int32_t> integer_reader(const char*) {
  return nullptr;
}
Reader<double> double_reader(const char*) {
  return nullptr;
}
Reader<double> time_reader(const char*, const char16_t*) {
  return nullptr;
}

}  // namespace bench::icu

namespace bench::unistring {

std::string version() {
  return "";
}

Work convert(const Input&, const Encoding&, const Encoding&) {
  return nullptr;
}
Work map(const Input&, const Encoding&, const char*, bool) {
  return nullptr;
}
Work count_chars(const Input&, const Encoding&) {
  return nullptr;
}
Work walk(const Input&, const Encoding&) {
  return nullptr;
}

}  // namespace bench::unistring
