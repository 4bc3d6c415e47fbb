// Damaged files: takes one small file of every kind of a locale directory, and catalogs, changes it in every way of
// mutants.h, and uses all that reads it, in child processes. What a child dies of, or does not end with in time, is
// reported with the kind, the offset and the change, and a new child goes on behind it.
#include <fcntl.h>
#include <sys/mman.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/time.h>
#include <sys/wait.h>
#include <unistd.h>

#include <CLI/CLI.hpp>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <map>

#include "mutants.h"
#include "small_files.h"
#include "use.h"

extern "C" const char* __asan_default_options() {
  return "quarantine_size_mb=16:malloc_context_size=2:allocator_may_return_null=1:detect_stack_use_after_"
         "return=0";
}

extern "C" const char* __ubsan_default_options() {
  return "print_stacktrace=1";
}

namespace mutate {
namespace {

using lx::test::ScratchDirectory;

struct Options {
  uint32_t seed = 1;
  size_t random = 2000;  // mutants by seed, of each kind
  size_t jobs = 2;
  size_t step = 1;
  int seconds = 10;  // of processor time, of a mutant
  std::string kind;
  size_t only = SIZE_MAX;
};

/// One kind of file and its mutants; `first` is the number of its first mutant among all.
struct Batch {
  const SmallFile& file;
  Mutants mutants;
  size_t first;
};

/// Mutants that are shown of each fault.
constexpr size_t kShown = 3;

/// Where a child is, for its parent.
struct Progress {
  size_t at;    // among all mutants
  size_t used;  // mutants that were not the file itself
};

class Run {
 public:
  explicit Run(const Options& options) : options_(options) {
    for (const SmallFile& file : files_.all()) {
      if (!options.kind.empty() && file.kind != options.kind) continue;
      batches_.push_back({file, {file.bytes, file.big_endian, options.seed, options.random}, total_});
      const Mutants& mutants = batches_.back().mutants;
      total_ += mutants.count();
      std::cout << file.kind << ": " << mutants.whole().size() << " bytes, " << mutants.count() / file.step
                << " mutants\n";
    }
    if (batches_.empty()) throw std::runtime_error("no kind " + options.kind);
    progress_ = static_cast<Progress*>(mmap(nullptr, options.jobs * sizeof(Progress), PROT_READ | PROT_WRITE,
                                            MAP_SHARED | MAP_ANONYMOUS, -1, 0));
    if (progress_ == MAP_FAILED) throw std::runtime_error("no shared memory");
  }

  /// One mutant, in this process.
  void one(size_t number) const {
    const ScratchDirectory directory;
    files_.write(directory);
    const Batch& batch = batches_.front();
    ByteString mutant;
    batch.mutants.make(number, &mutant);
    std::cout << batch.file.kind << ", " << batch.mutants.name(number) << std::endl;
    directory.write(batch.file.name, mutant);
    use_directory(directory, files_, batch.file, static_cast<uint32_t>(number));
  }

  /// All of them: how many faults were found.
  size_t all() {
    std::map<pid_t, size_t> jobs;  // by child
    for (size_t job = 0; job < options_.jobs; ++job) {
      progress_[job].at = job * options_.step;
      jobs[start(job)] = job;
    }
    while (!jobs.empty()) {
      int status = 0;
      const pid_t child = wait(&status);
      const auto found = jobs.find(child);
      if (found == jobs.end()) continue;
      const size_t job = found->second;
      jobs.erase(found);
      if (status == 0) continue;
      report(job, status);
      progress_[job].at += options_.jobs * options_.step;
      jobs[start(job)] = job;
    }
    return say();
  }

 private:
  std::string log_name(size_t job) const { return logs_.file("job" + std::to_string(job)); }

  pid_t start(size_t job) {
    std::cout.flush();
    const pid_t child = fork();
    if (child < 0) throw std::runtime_error("no child process");
    if (child != 0) return child;
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    const int log = open(log_name(job).c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0600);
    dup2(log, STDERR_FILENO);
    close(log);
    work(job);
    exit(0);
  }

  /// Every mutant of a job from its place on.
  void work(size_t job) const {
    Progress& progress = progress_[job];
    const ScratchDirectory directory;
    files_.write(directory);
    ByteString mutant;
    for (const Batch& batch : batches_) {
      const size_t end = batch.first + batch.mutants.count();
      for (; progress.at < end; progress.at += options_.jobs * options_.step) {
        const size_t number = progress.at - batch.first;
        if (number % batch.file.step != 0) continue;
        if (!batch.mutants.make(number, &mutant)) continue;
        directory.write(batch.file.name, mutant);
        const itimerval limit{{}, {options_.seconds, 0}};
        setitimer(ITIMER_PROF, &limit, nullptr);
        use_directory(directory, files_, batch.file, static_cast<uint32_t>(number));
        ++progress.used;
      }
      directory.write(batch.file.name, batch.mutants.whole());
    }
  }

  /// The mutant that a child ended with, and what it said.
  void report(size_t job, int status) {
    const size_t at = progress_[job].at;
    size_t i = batches_.size() - 1;
    while (batches_[i].first > at) --i;
    std::string why =
        WIFSIGNALED(status) && WTERMSIG(status) == SIGPROF ? "takes too long" : "ends the process";
    std::ifstream log(log_name(job));
    std::string place;
    for (std::string line; std::getline(log, line);) {
      if (line.find("what():") != std::string::npos || line.find("SUMMARY") != std::string::npos ||
          line.find("runtime error:") != std::string::npos)
        why = line;
      // The first frame in the library's sources tells more than one of the runtime's.
      if (place.empty() && line.find("    #") == 0 && line.find("/src/") != std::string::npos)
        place = line.substr(line.find("/src/"));
    }
    size_t& count = faults_[why + " " + place];
    if (++count > kShown) return;
    if (at >= total_) {
      std::cout << "at the end: " << why << " " << place << std::endl;
    } else {
      const Batch& batch = batches_[i];
      const size_t number = at - batch.first;
      std::cout << batch.file.kind << " " << number << ", " << batch.mutants.name(number) << ": " << why << " "
                << place << std::endl;
    }
  }

  size_t say() const {
    size_t used = 0, faults = 0;
    for (size_t job = 0; job < options_.jobs; ++job) used += progress_[job].used;
    for (const auto& [what, count] : faults_) {
      std::cout << count << " x " << what << "\n";
      faults += count;
    }
    std::cout << used + faults << " mutants of " << batches_.size() << " files, " << 8 * sizeof(void*)
              << " bits: " << faults << " faults" << std::endl;
    return faults;
  }

  Options options_;
  SmallFiles files_;
  std::vector<Batch> batches_;
  size_t total_ = 0;
  Progress* progress_ = nullptr;
  ScratchDirectory logs_;
  std::map<std::string, size_t> faults_;
};

}  // namespace
}  // namespace mutate

int main(int argc, char** argv) {
  mutate::Options options;
  CLI::App app("Uses the library on every damaged form of a small file of every kind.", "mutate");
  app.add_option("--seed", options.seed, "of the places changed at random");
  app.add_option("--random", options.random, "mutants of each kind that are changed at random");
  app.add_option("--jobs", options.jobs, "processes at a time")->check(CLI::PositiveNumber);
  app.add_option("--step", options.step, "only every so many mutants")->check(CLI::PositiveNumber);
  app.add_option("--seconds", options.seconds, "processor time that a mutant may take");
  app.add_option("--kind", options.kind, "files of this kind alone");
  app.add_option("--only", options.only, "this mutant of the kind, in this process");
  CLI11_PARSE(app, argc, argv);
  // A million files are written: in memory, where the caller does not say otherwise.
  if (access("/dev/shm", W_OK) == 0) setenv("TMPDIR", "/dev/shm", 0);
  try {
    mutate::Run run(options);
    if (options.only == SIZE_MAX) return run.all() == 0 ? 0 : 1;
    run.one(options.only);
    return 0;
  } catch (const std::exception& error) {
    std::cerr << "mutate: " << error.what() << "\n";
    return 2;
  }
}
