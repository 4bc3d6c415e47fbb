// Compiling a directory: all objects at once, then what is to be said of them, then the files.
#include "compile_directory.h"

#include <algorithm>
#include <filesystem>
#include <iterator>
#include <map>
#include <ostream>
#include <set>
#include <sstream>

#include "alias_source.h"
#include "control_source.h"
#include "core/lxformat.h"
#include "files.h"
#include "lexicor/hex.h"
#include "line_text.h"
#include "object_check.h"
#include "parallel.h"
#include "sort_sources.h"

namespace lexicor_data {
namespace {

namespace fs = std::filesystem;
namespace format = lx::format;

constexpr char kControlSource[] = "control.txt";

/// A text file as the library reads it, without a byte-order mark and with line feeds as line ends.
ByteVector plain_lines(const std::string& path) {
  std::istringstream in = open_source(path);
  std::string text, line;
  for (int number = 0; next_line(in, &line, &number);) text += line + '\n';
  return ByteVector(text.begin(), text.end());
}

/// The digests of source files, each read once.
class SourceDigests {
 public:
  explicit SourceDigests(const std::string& directory) : directory_(directory) {}

  /// Of a path in the directory; empty when there is no such file.
  const std::string& of(const std::string& path) {
    const auto [entry, is_new] = digests_.try_emplace(path);
    if (is_new) entry->second = read(path);
    return entry->second;
  }

  /// Reads the sources of a manifest at once; threads may ask for them together then.
  void read_all(const Manifest& manifest) {
    for (const ManifestObject& object : manifest.objects)
      for (const auto& source : object.sources) digests_.try_emplace(source.first);
    std::vector<std::pair<const std::string, std::string>*> entries;
    for (auto& entry : digests_) entries.push_back(&entry);
    for_each_parallel(entries.size(), [&](size_t i) { entries[i]->second = read(entries[i]->first); });
  }

 private:
  std::string read(const std::string& path) const {
    const std::string file = directory_ + '/' + path;
    return fs::is_regular_file(file) ? digest_text(digest_of_bytes(read_file(file))) : "";
  }

  const std::string& directory_;
  std::map<std::string, std::string> digests_;
};

/// The root and the rules of sorts go along: users' rules build on them.
void add_rules(const std::string& source, const Control& control,
               std::vector<std::pair<std::string, ByteVector>>& files) {
  const std::string directory = std::string(kSortDirectory) + '/';
  if (!std::filesystem::exists(source + '/' + directory + kRootFile)) return;
  files.emplace_back(directory + kRootFile, plain_lines(source + '/' + directory + kRootFile));
  for (const ObjectName& name : control.objects) {
    const std::string file = directory + name.name + kRulesExtension;
    if (name.type == ObjectType::kSort && std::filesystem::exists(source + '/' + file))
      files.emplace_back(file, plain_lines(source + '/' + file));
  }
}

/// Rules in the directory of sorts that have none in the source any more.
void remove_stale_rules(const std::string& source, const std::string& out, const Control& control,
                        std::ostream& log) {
  for (const ObjectName& name : control.objects) {
    const std::string file = std::string(kSortDirectory) + '/' + name.name + kRulesExtension;
    if (name.type != ObjectType::kSort || fs::exists(source + '/' + file)) continue;
    if (fs::remove(out + '/' + file))
      log << out << '/' << file << ": removed, the sort has no rules any more\n";
  }
}

void describe(std::ostream& out, const LeftOut& left_out) {
  out << "  <U" << lexicor_cli::hex_text(left_out.mapping.unicode, 4) << "> "
      << lexicor_cli::hex_text(left_out.mapping.code, 2 * left_out.mapping.bytes) << " |"
      << static_cast<int>(left_out.mapping.precision) << ' ' << left_out.reason << '\n';
}

/// "left out: 3 no room, 1 beyond U+FFFF".
std::string count_left_out(const std::vector<LeftOut>& left_out) {
  std::map<std::string, size_t> counts;
  for (const LeftOut& entry : left_out) ++counts[entry.reason];
  std::string text = "left out:";
  const char* separator = " ";
  for (const auto& [reason, count] : counts) {
    text += separator + std::to_string(count) + ' ' + reason;
    separator = ", ";
  }
  return text;
}

/// One object of the directory, compiled or taken from an earlier run.
struct Made {
  CompiledObject object;
  ManifestObject entry;
};

class DirectoryCompiler {
 public:
  DirectoryCompiler(const std::string& source, const std::string& out, const CompileOptions& options,
                    std::ostream& log)
      : source_(source),
        out_(out),
        options_(options),
        log_(log),
        digests_(source),
        sorts_(sort_directory(source)) {}

  void run() {
    control_ = read_source_control(source_);
    made_.resize(control_.objects.size());
    SourceErrors errors;
    errors.attempt([&] {
      std::istringstream aliases = open_source(alias_file());
      read_aliases(aliases, alias_file(), control_);
    });
    make_objects(errors);
    errors.throw_if_any();
    say_notes();
    write();
    remove_unlisted(out_, control_, log_);
    remove_stale_rules(source_, out_, control_, log_);
  }

 private:
  std::string alias_file() const { return source_ + '/' + format::kAliasFile; }

  void make_objects(SourceErrors& errors) {
    std::vector<size_t> changed;
    const Manifest earlier = earlier_manifest();
    digests_.read_all(earlier);
    std::vector<uint8_t> taken(made_.size());
    for_each_parallel(made_.size(),
                      [&](size_t i) { taken[i] = take_earlier(earlier.find(control_.objects[i]), made_[i]); });
    for (size_t i = 0; i < made_.size(); ++i)
      if (!taken[i]) changed.push_back(i);
    std::vector<SourceErrors> faults(made_.size());
    const ValidatorInUse validator;
    for_each_parallel(changed.size(), [&](size_t n) {
      const size_t i = changed[n];
      faults[i].attempt([&] { made_[i].object = compile(control_.objects[i]); });
    });
    for (const SourceErrors& of_object : faults)
      for (const SourceError& error : of_object.list()) errors.add(error);
    if (!errors.empty()) return;
    for (const size_t i : changed) describe_made(control_.objects[i], made_[i]);
  }

  // -- what an earlier run made -------------------------------------------------------------------------------

  /// Nothing, when there is none or another compiler may have written it.
  Manifest earlier_manifest() const {
    Manifest none;
    const std::string file = out_ + '/' + kManifestFile;
    if (options_.all || options_.verbose || !options_.report_file.empty()) return none;
    std::error_code error;
    const fs::path program = fs::read_symlink("/proc/self/exe", error);
    if (error || !fs::is_regular_file(file, error)) return none;
    const auto program_time = fs::last_write_time(program, error);
    if (error || fs::last_write_time(file, error) <= program_time) return none;
    try {
      Manifest manifest = read_manifest(read_file(file), file);
      return manifest.compiler == kCompilerVersion ? manifest : none;
    } catch (const SourceError&) {
      return none;
    }
  }

  /// Whether the object would be made of the same file. A fault is said where it is compiled.
  bool has_its_source(const ManifestObject& entry) const {
    try {
      return entry.sources.count(in_source(source_path(source_, entry.name))) != 0;
    } catch (const SourceError&) {
      return false;
    }
  }

  /// Takes an object whose sources and whose file are what they were.
  bool take_earlier(const ManifestObject* entry, Made& made) {
    if (entry == nullptr || entry->file != object_file_name(entry->name) || entry->sources.empty())
      return false;
    if (!has_its_source(*entry)) return false;
    for (const auto& [path, digest] : entry->sources)
      if (digests_.of(path) != digest) return false;
    const std::string file = out_ + '/' + entry->file;
    if (!fs::is_regular_file(file)) return false;
    made.object.bytes = read_file(file);
    if (digest_text(digest_of_bytes(made.object.bytes)) != entry->sha256) return false;
    made.entry = *entry;
    return true;
  }

  // -- compiling ----------------------------------------------------------------------------------------------

  CompiledObject compile(const ObjectName& name) {
    const std::string file = source_path(source_, name);
    std::istringstream in = open_source(file);
    return compile_object(in, file, name, control_, &sorts_);
  }

  /// Notes name files by their paths in the source directory, so that they are the same wherever it stands.
  std::string in_source(const std::string& text) const {
    const std::string beginning = source_ + '/';
    return text.compare(0, beginning.size(), beginning) == 0 ? text.substr(beginning.size()) : text;
  }

  void describe_made(const ObjectName& name, Made& made) {
    made.entry = describe_object(name, made.object.bytes);
    const std::string file = in_source(source_path(source_, name));
    made.entry.sources[file] = digests_.of(file);
    // A language names other objects.
    if (name.type == ObjectType::kLanguage) made.entry.sources[kControlSource] = digests_.of(kControlSource);
    for (const std::string& base : made.object.bases)
      made.entry.sources[in_source(base)] = digests_.of(in_source(base));
    std::vector<std::string>& notes = made.entry.notes;
    for (const std::string& warning : made.object.warnings) notes.push_back(in_source(warning));
    if (made.object.retyped_chars != 0)
      notes.push_back(file + ": " + std::to_string(made.object.retyped_chars) +
                      " characters of unassigned type have the type of their row");
    if (!made.object.left_out.empty()) notes.push_back(file + ": " + count_left_out(made.object.left_out));
  }

  // -- what is said -------------------------------------------------------------------------------------------

  void say_notes() const {
    std::set<std::string> used;
    for (const Made& made : made_) {
      if (options_.verbose) say_sizes(made);
      for (const std::string& note : made.entry.notes) log_ << source_ << '/' << note << '\n';
      for (const LeftOut& entry : made.object.left_out)
        if (options_.verbose) describe(log_, entry);
      for (const std::string& note : made.object.sort_notes)
        if (options_.verbose) log_ << source_path(source_, made.entry.name) << ": " << note << '\n';
      for (const auto& [path, digest] : made.entry.sources) used.insert(path);
    }
    say_unused(source_, log_, [&](const std::string& file) { return used.count(file) != 0; });
  }

  void say_sizes(const Made& made) const {
    log_ << made.entry.file << ' ' << made.entry.name.name << ':';
    for (const ByteVector& section : read_object(made.object.bytes, made.entry.file).sections)
      log_ << ' ' << section.size();
    log_ << '\n';
  }

  ByteVector report() const {
    std::ostringstream text;
    for (const Made& made : made_) {
      for (const std::string& note : made.object.sort_notes)
        text << in_source(source_path(source_, made.entry.name)) << ": " << note << '\n';
      if (made.object.left_out.empty()) continue;
      text << source_file_name(made.entry.name) << ": " << count_left_out(made.object.left_out) << '\n';
      for (const LeftOut& entry : made.object.left_out) describe(text, entry);
    }
    const std::string bytes = text.str();
    return ByteVector(bytes.begin(), bytes.end());
  }

  // -- files --------------------------------------------------------------------------------------------------

  void write() {
    // Ahead of the directory: when it cannot be written nothing is.
    if (!options_.report_file.empty()) write_file(options_.report_file, report());
    Manifest manifest;
    std::vector<std::pair<std::string, ByteVector>> files;
    for (Made& made : made_) {
      manifest.objects.push_back(made.entry);
      files.emplace_back(made.entry.file, std::move(made.object.bytes));
    }
    files.emplace_back(format::kAliasFile, plain_lines(alias_file()));
    add_rules(source_, control_, files);
    write_directory(out_, files, manifest, compile_control(control_, source_ + '/' + kControlSource));
  }

  const std::string& source_;
  const std::string& out_;
  const CompileOptions& options_;
  std::ostream& log_;
  Control control_;
  SourceDigests digests_;
  SortSources sorts_;
  std::vector<Made> made_;  ///< in the order of control_
};

bool holds_bytes(const std::string& path, const ByteVector& bytes) {
  std::error_code error;
  return fs::file_size(path, error) == bytes.size() && !error && read_file(path) == bytes;
}

}  // namespace

Control read_source_control(const std::string& directory) {
  const std::string file_name = directory + '/' + kControlSource;
  std::istringstream in = open_source(file_name);
  return read_control(in, file_name);
}

void say_unused(const std::string& directory, std::ostream& log,
                const std::function<bool(const std::string&)>& is_used) {
  std::vector<std::string> unused;
  for (const std::string& folder : source_folders()) {
    std::error_code error;
    for (const auto& entry : fs::directory_iterator(directory + '/' + folder, error)) {
      const std::string file = entry.path().filename().string();
      if (!entry.is_regular_file() || file[0] == '.' || file.back() == '~') continue;
      if (!is_used(folder + '/' + file)) unused.push_back(folder + '/' + file);
    }
  }
  std::sort(unused.begin(), unused.end());
  for (const std::string& path : unused)
    log << directory << '/' << path << ": is not used, " << kControlSource << " does not list it\n";
}

void remove_unlisted(const std::string& out, const Control& control, std::ostream& log) {
  std::set<std::string> listed{format::kControlFile};
  for (const ObjectName& name : control.objects) listed.insert(object_file_name(name));
  std::vector<fs::path> unlisted;
  for (const auto& entry : fs::directory_iterator(out)) {
    if (entry.path().extension() != format::kDataExtension || !entry.is_regular_file()) continue;
    if (listed.count(entry.path().filename().string()) == 0) unlisted.push_back(entry.path());
  }
  std::sort(unlisted.begin(), unlisted.end());
  for (const fs::path& path : unlisted) {
    try {
      if (read_object(read_file(path.string()), path.string()).compiler == 0) continue;
    } catch (const SourceError&) {
      continue;
    }
    fs::remove(path);
    log << path.string() << ": removed, it is not listed any more\n";
  }
}

void write_directory(const std::string& out, const std::vector<std::pair<std::string, ByteVector>>& files,
                     const Manifest& manifest, const ByteVector& control) {
  std::error_code error;
  Manifest complete = manifest;
  for (const auto& [name, bytes] : files) {
    fs::create_directories(fs::path(out + '/' + name).parent_path(), error);
    if (!holds_bytes(out + '/' + name, bytes)) write_file(out + '/' + name, bytes);
    const bool is_object = fs::path(name).extension() == format::kDataExtension;
    if (!is_object) complete.files[name] = digest_text(digest_of_bytes(bytes));
  }
  complete.files[format::kControlFile] = digest_text(digest_of_bytes(control));
  write_file(out + '/' + kManifestFile, write_manifest(complete));
  write_file(out + '/' + format::kControlFile, control);
}

void compile_directory(const std::string& source, const std::string& out, const CompileOptions& options,
                       std::ostream& log) {
  DirectoryCompiler(source, out, options, log).run();
}

}  // namespace lexicor_data
