// Names of codepages: those of the table, ICU's, and the forms that a number or a part of ISO 8859 suggests.
#include "alias_import.h"

#include <unicode/ucnv.h>

#include <cstring>
#include <map>
#include <ostream>
#include <set>
#include <stdexcept>

namespace lexicor_import {
namespace {

constexpr size_t kMaxAliasBytes = 64;
constexpr size_t kMaxLineBytes = 110;

// ICU's names of a converter file (UTR22) and of nothing else are not among them.
constexpr const char* kStandards[] = {"MIME", "IANA", "WINDOWS", "IBM", "JAVA", ""};

std::string upper(std::string text) {
  for (char& c : text) {
    if (c >= 'a' && c <= 'z') c = static_cast<char>(c - ('a' - 'A'));
  }
  return text;
}

bool starts_with(const std::string& text, const char* start) {
  return text.compare(0, std::strlen(start), start) == 0;
}

bool is_digits(const std::string& text) {
  return text.find_first_not_of("0123456789") == std::string::npos;
}

/// Whether a name can stand in the file. A decimal number is an identifier, not a name; one with a leading zero
/// (037) is how people write it all the same.
bool is_usable(const std::string& name) {
  if (name.empty() || name.size() > kMaxAliasBytes || name[0] == '#') return false;
  for (char c : name) {
    if (c <= ' ' || c > '~') return false;
  }
  return !is_digits(name) || name[0] == '0';
}

std::vector<std::string> icu_names(const char* converter) {
  std::vector<std::string> names;
  for (const char* standard : kStandards) {
    UErrorCode error = U_ZERO_ERROR;
    UEnumeration* list = ucnv_openStandardNames(converter, standard, &error);
    if (U_FAILURE(error) || list == nullptr) continue;
    int32_t length = 0;
    while (const char* name = uenum_next(list, &length, &error)) names.emplace_back(name);
    uenum_close(list);
  }
  return names;
}

/// Whether ICU opens this converter under the name.
bool is_default(const std::string& name, const char* converter) {
  UErrorCode error = U_ZERO_ERROR;
  const char* first = ucnv_getAlias(name.c_str(), 0, &error);
  return U_SUCCESS(error) && first != nullptr && std::strcmp(first, converter) == 0;
}

/// Whether IANA has the codepage under a name of five digits: IBM00858, IBM01140.
bool has_euro_name(uint16_t id) {
  return id == 858 || (id >= 1140 && id <= 1149);
}

/// Whether the identifier is what IBM calls the codepage; others are of a registry or of vendors.
bool has_ibm_number(const Codepage& codepage) {
  static const std::set<uint16_t> registry{115, 119, 2082, 2259};
  return codepage.id < 10000 && registry.count(codepage.id) == 0 && !starts_with(codepage.name, "CP");
}

std::vector<std::string> customary_names(const Codepage& codepage) {
  const std::string name = codepage.name, id = std::to_string(codepage.id);
  std::vector<std::string> names;
  if (starts_with(name, "IBM")) {
    const std::string number = std::to_string(std::stoul(name.substr(3))), padded = name.substr(3);
    for (const char* form : {"ibm", "ibm-", "cp", "cp-", "ccsid", "csIBM"}) {
      names.push_back(form + number);
      names.push_back(form + padded);
    }
    if (has_euro_name(codepage.id)) names.push_back("csIBM" + std::string(5 - number.size(), '0') + number);
  } else if (starts_with(name, "MS")) {
    for (const char* form :
         {"windows-", "windows", "cp", "win", "win-", "ms-", "cswindows", "x-cp", "dos-", "ms"})
      names.push_back(form + id);
  } else if (starts_with(name, "ISO-8859-")) {
    const std::string part = name.substr(9);
    for (const char* form :
         {"iso8859-", "iso_8859-", "iso8859_", "iso8859", "iso-8859_", "8859-", "8859_", "csISO8859"}) {
      names.push_back(form + part);
    }
    names.push_back("windows-" + std::to_string(28590 + std::stoul(part)));
  }
  if (!starts_with(name, "IBM") && has_ibm_number(codepage)) {
    for (const char* form : {"cp", "ibm-", "ibm"}) names.push_back(form + id);
  }
  return names;
}

class AliasFile {
 public:
  explicit AliasFile(const std::vector<Codepage>& codepages) : codepages_(codepages), names_(codepages.size()) {
    for (size_t i = 0; i < codepages.size(); ++i) {
      if (!object_names_.insert(upper(codepages[i].name)).second) {
        throw std::runtime_error("two codepages have the name " + std::string(codepages[i].name));
      }
    }
  }

  void claim(size_t codepage, const std::string& name) {
    if (!is_usable(name) || object_names_.count(upper(name)) != 0) return;
    if (taken_.insert(upper(name)).second) names_[codepage].push_back(name);
  }

  /// The table's own lists: they may not contradict each other.
  void claim_listed(size_t codepage) {
    for (const std::string& name : words(codepages_[codepage].aliases)) {
      if (taken_.count(upper(name)) != 0) throw std::runtime_error("alias " + name + " is listed twice");
      claim(codepage, name);
    }
  }

  void write(std::ostream& out) const {
    for (size_t i = 0; i < codepages_.size(); ++i) {
      std::string line = codepages_[i].name;
      for (const std::string& name : names_[i]) {
        if (line.size() + 1 + name.size() > kMaxLineBytes) {
          out << line << '\n';
          line.clear();
        }
        line += ' ' + name;
      }
      out << line << '\n';
    }
  }

 private:
  const std::vector<Codepage>& codepages_;
  std::vector<std::vector<std::string>> names_;  ///< by codepage
  std::set<std::string> object_names_;
  std::set<std::string> taken_;
};

}  // namespace

void write_aliases(std::ostream& out, const std::vector<Codepage>& codepages) {
  AliasFile file(codepages);
  for (size_t i = 0; i < codepages.size(); ++i) file.claim_listed(i);
  for (const bool only_defaults : {true, false}) {
    std::set<std::string> seen;  // of two codepages on one converter, the first has its names
    for (size_t i = 0; i < codepages.size(); ++i) {
      if (codepages[i].origin == kGlibc || !seen.insert(codepages[i].table).second) continue;
      for (const std::string& name : icu_names(codepages[i].table)) {
        if (!only_defaults || is_default(name, codepages[i].table)) file.claim(i, name);
      }
    }
  }
  for (size_t i = 0; i < codepages.size(); ++i) {
    for (const std::string& name : customary_names(codepages[i])) file.claim(i, name);
  }
  out << "# Other names of the codepages, without regard to case: IANA's, vendors' and customary ones.\n"
         "# Written by lexicor-import; a line that begins with a blank goes on with the codepage above it.\n";
  file.write(out);
}

}  // namespace lexicor_import
