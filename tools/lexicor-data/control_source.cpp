// Text and binary forms of the object list; both pass through one check of order, identifiers and names.
#include "control_source.h"

#include <algorithm>
#include <istream>
#include <ostream>
#include <sstream>

#include "core/lxbytes.h"
#include "core/lxformat.h"
#include "line_text.h"
#include "source_error.h"

namespace lexicor_data {
namespace {

namespace format = lx::format;

constexpr size_t kMaxNameBytes = sizeof(format::ControlRecord::name) - 1;

std::string lower_ascii(std::string text) {
  for (char& c : text) {
    if (c >= 'A' && c <= 'Z') c = static_cast<char>(c + ('a' - 'A'));
  }
  return text;
}

/// What is wrong with a name, or an empty text. A name is also a file name of the source tree.
std::string name_fault(ObjectType type, const std::string& name) {
  if (name.empty()) return "the name is empty";
  if (name.size() > kMaxNameBytes) return "the name is longer than 33 bytes";
  for (char c : name) {
    if (c <= ' ' || c > '~' || c == '/' || c == '#' || c == '"') {
      return "the name holds a space, a slash, #, a quote or a character outside ASCII";
    }
  }
  if (name[0] == '.') return "the name begins with a dot";
  if (type == ObjectType::kSort && lower_ascii(name) == "binary")
    return "Binary is the order without an object";
  return "";
}

/// Throws for duplicates among objects in order.
void refuse_duplicates(const Control& control, const std::string& file_name) {
  for (size_t i = 0; i < control.objects.size(); ++i) {
    const ObjectName& object = control.objects[i];
    for (size_t j = 0; j < i; ++j) {
      const ObjectName& other = control.objects[j];
      if (object.type != other.type) continue;
      const int line = std::max(object.line, other.line);
      if (object.id == other.id) {
        throw SourceError(file_name, line, 1, "identifier " + std::to_string(object.id) + " is used twice");
      }
      if (lower_ascii(object.name) == lower_ascii(other.name)) {
        throw SourceError(file_name, line, 1, "name " + object.name + " is used twice");
      }
    }
  }
}

ObjectName parse_line(const std::string& text, const std::string& file_name, int line) {
  struct Token {
    std::string text;
    int column;
  };
  std::vector<Token> tokens;
  for (size_t i = 0; i < text.size();) {
    if (text[i] == ' ' || text[i] == '\t') {
      ++i;
      continue;
    }
    const size_t end = std::min(text.find_first_of(" \t", i), text.size());
    tokens.push_back({text.substr(i, end - i), static_cast<int>(i) + 1});
    i = end;
  }
  auto fail = [&](size_t token, const std::string& what) {
    throw SourceError(file_name, line, tokens[token].column, what);
  };
  if (tokens.size() != 3) fail(0, "expected: type identifier name");
  const auto type = std::find(std::begin(kTypeNames), std::end(kTypeNames), tokens[0].text);
  if (type == std::end(kTypeNames)) fail(0, "unknown type " + tokens[0].text);
  ObjectName object;
  object.type = static_cast<ObjectType>(type - std::begin(kTypeNames));
  unsigned id = 0;
  for (char c : tokens[1].text) {
    if (c < '0' || c > '9' || id > 65535) fail(1, "the identifier is not a number from 1 to 65535");
    id = id * 10 + static_cast<unsigned>(c - '0');
  }
  if (id < 1 || id > 65535) fail(1, "the identifier is not a number from 1 to 65535");
  object.id = static_cast<uint16_t>(id);
  object.name = tokens[2].text;
  object.line = line;
  const std::string fault = name_fault(object.type, object.name);
  if (!fault.empty()) fail(2, fault);
  return object;
}

}  // namespace

const ObjectName* Control::find(ObjectType type, uint16_t id) const {
  for (const ObjectName& object : objects) {
    if (object.type == type && object.id == id) return &object;
  }
  return nullptr;
}

const ObjectName* Control::find(ObjectType type, const std::string& name) const {
  for (const ObjectName& object : objects) {
    if (object.type == type && lower_ascii(object.name) == lower_ascii(name)) return &object;
  }
  return nullptr;
}

Control read_control(std::istream& in, const std::string& file_name) {
  Control control;
  SourceErrors errors;
  std::string text;
  for (int line = 0; !errors.full() && next_line(in, &text, &line);) {
    text.resize(std::min(text.find('#'), text.size()));
    if (text.find_first_not_of(" \t") == std::string::npos) continue;
    errors.attempt([&] { control.objects.push_back(parse_line(text, file_name, line)); });
  }
  errors.throw_if_any();
  if (control.objects.empty()) throw SourceError(file_name, 0, 0, "lists no objects");
  refuse_duplicates(control, file_name);
  std::sort(control.objects.begin(), control.objects.end(), [](const ObjectName& a, const ObjectName& b) {
    return a.type != b.type ? a.type < b.type : a.id < b.id;
  });
  return control;
}

void write_control(std::ostream& out, const Control& control) {
  for (const ObjectName& object : control.objects) {
    out << kTypeNames[static_cast<size_t>(object.type)] << ' ' << object.id << ' ' << object.name << '\n';
  }
}

ByteVector pack_control(const Control& control) {
  ByteVector table;
  for (const ObjectName& object : control.objects) {
    format::ControlRecord record{object.id, static_cast<uint8_t>(object.type)};
    object.name.copy(record.name, sizeof(record.name));
    append_record(table, record);
  }
  return table;
}

Control unpack_control(const ByteVector& section, const std::string& file_name) {
  Control control;
  if (section.size() % format::ControlRecord::kBytes != 0) {
    throw SourceError(file_name, 0, 0, "the entry table is not a whole number of 38-byte records");
  }
  for (size_t at = 0; at < section.size(); at += format::ControlRecord::kBytes) {
    auto fail = [&](const std::string& what) {
      throw SourceError(file_name, 0, 0,
                        "record " + std::to_string(at / format::ControlRecord::kBytes) + ": " + what);
    };
    const auto record = record_at<format::ControlRecord>(section, at);
    if (record.type >= format::kTypes) fail("the type is not 0 to 3");
    if (record.flags != 0) fail("the flags byte is not 0");
    const size_t name_bytes = strnlen(record.name, sizeof(record.name));
    if (name_bytes == sizeof(record.name)) fail("the name has no terminator");
    ObjectName object{static_cast<ObjectType>(record.type), record.id, {record.name, name_bytes}, 0};
    if (object.id == 0) fail("the identifier is 0");
    const std::string fault = name_fault(object.type, object.name);
    if (!fault.empty()) fail(fault);
    if (!control.objects.empty()) {
      const ObjectName& previous = control.objects.back();
      if (object.type < previous.type) fail("types do not ascend");
      if (object.type == previous.type && object.id <= previous.id) fail("identifiers do not ascend");
    }
    control.objects.push_back(object);
  }
  refuse_duplicates(control, file_name);
  return control;
}

}  // namespace lexicor_data
