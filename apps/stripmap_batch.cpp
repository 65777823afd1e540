// stripmap_batch: many scenes at once. Runs a list of job files (or the job
// files of folders) through stripmap_focuser, each in a working folder of
// its own, on this machine N at a time or as a Slurm job array; follows the
// runs through their progress files, stops them through those files, and
// writes a summary of every scene.
#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <string>
#include <vector>

#include "batch/batch_job.h"
#include "batch/batch_run.h"

namespace {

namespace fs = std::filesystem;

constexpr const char* kUsage =
    "usage: stripmap_batch [options] JOB_FILE|FOLDER...\n"
    "       stripmap_batch --out DIR [options]     (again the job files of DIR's last run)\n"
    "       stripmap_batch --out DIR --stop | --summary\n"
    "  --out DIR            batch folder: a working folder per scene, progress.txt, summary.csv,\n"
    "                       summary.json (default: ./batch)\n"
    "  --local N            N scenes at a time on this machine (default: as many as the cores\n"
    "                       and the jobs' Memory budgets allow)\n"
    "  --slurm              one Slurm job array, a task per scene\n"
    "  --all                run every scene, also those that already have their product\n"
    "  --retries K          Slurm: K chained arrays that rerun the failed tasks\n"
    "  --cpus-per-task N    Slurm: cores of a task (1)\n"
    "  --sbatch ARG         Slurm: an argument for sbatch (repeatable), e.g. --sbatch=--time=2:00:00\n"
    "  --no-wait            Slurm: submit and return (then --summary once the array has ended)\n"
    "  --memory-margin MB   added to a job's Memory budget for its memory request (256)\n"
    "  --focuser PATH       the focuser (default: stripmap_focuser beside this program)\n"
    "  --quiet              no progress lines\n"
    "  --stop               stop the running scenes of the batch DIR, cancel its queued tasks\n"
    "  --summary            write the summary of the batch DIR from its working folders\n"
    "Exit status: 0 every scene has its product, 1 some have not, 2 the batch was not run.\n";

int usageError(const std::string& message) {
  std::fprintf(stderr, "stripmap_batch: %s\n%s", message.c_str(), kUsage);
  return 2;
}

bool positiveNumber(const char* text, int& value) {
  char* end = nullptr;
  const long v = std::strtol(text, &end, 10);
  if (!end || *end != '\0' || v < 0 || v > 100000) return false;
  value = static_cast<int>(v);
  return true;
}

fs::path selfPath() {
  std::error_code ec;
  fs::path self = fs::read_symlink("/proc/self/exe", ec);
  return ec ? fs::path("stripmap_batch") : self;
}

// One Slurm array task: `--task LIST INDEX [--if-failed]`.
int taskMain(int argc, char** argv, batch::Options options) {
  if (argc < 4) return usageError("--task needs the batch list and the task index");
  std::vector<batch::Job> jobs;
  std::string error;
  if (!batch::readManifest(argv[2], jobs, error)) {
    std::fprintf(stderr, "stripmap_batch: %s\n", error.c_str());
    return 2;
  }
  const int index = std::atoi(argv[3]);
  const bool onlyIfFailed = argc > 4 && std::strcmp(argv[4], "--if-failed") == 0;
  options.batchDir = fs::absolute(argv[2]).parent_path().parent_path();
  if (const char* cpus = std::getenv("SLURM_CPUS_PER_TASK")) options.threadsPerRun = std::atoi(cpus);
  batch::installStopHandlers();
  for (const batch::Job& job : jobs)
    if (job.index == index) return batch::runTask(job, options, onlyIfFailed);
  std::fprintf(stderr, "stripmap_batch: no scene %d in %s\n", index, argv[2]);
  return 2;
}

}  // namespace

int main(int argc, char** argv) {
  batch::Options options;
  options.self = selfPath();
  options.focuser = options.self.parent_path() / "stripmap_focuser";
  if (argc > 1 && std::strcmp(argv[1], "--task") == 0) return taskMain(argc, argv, options);
  // A stop asked for while the batch starts is kept for the loop below.
  batch::installStopHandlers();

  std::string out = "batch";
  bool slurm = false, stop = false, summaryOnly = false;
  std::vector<std::string> inputs;
  for (int i = 1; i < argc; ++i) {
    const std::string a = argv[i];
    auto value = [&](const char* name) -> const char* {
      const std::string prefix = std::string(name) + "=";
      if (a.rfind(prefix, 0) == 0) return argv[i] + prefix.size();
      if (i + 1 >= argc) return nullptr;
      return argv[++i];
    };
    auto is = [&](const char* name) { return a == name || a.rfind(std::string(name) + "=", 0) == 0; };
    const char* v = nullptr;
    if (is("--out")) {
      if (!(v = value("--out"))) return usageError("--out needs a folder");
      out = v;
    } else if (is("--local")) {
      if (!(v = value("--local")) || !positiveNumber(v, options.parallel) || options.parallel < 1)
        return usageError("--local needs a number of scenes at a time");
    } else if (a == "--slurm") {
      slurm = true;
    } else if (a == "--all") {
      options.all = true;
    } else if (is("--retries")) {
      if (!(v = value("--retries")) || !positiveNumber(v, options.retries))
        return usageError("--retries needs a number");
    } else if (is("--cpus-per-task")) {
      if (!(v = value("--cpus-per-task")) || !positiveNumber(v, options.cpusPerTask) ||
          options.cpusPerTask < 1)
        return usageError("--cpus-per-task needs a number");
    } else if (is("--sbatch")) {
      if (!(v = value("--sbatch"))) return usageError("--sbatch needs an argument");
      options.sbatchArguments.push_back(v);
    } else if (a == "--no-wait") {
      options.wait = false;
    } else if (is("--memory-margin")) {
      if (!(v = value("--memory-margin")) || !positiveNumber(v, options.memoryMarginMb))
        return usageError("--memory-margin needs megabytes");
    } else if (is("--focuser")) {
      if (!(v = value("--focuser"))) return usageError("--focuser needs a path");
      options.focuser = fs::absolute(v);
    } else if (a == "--quiet") {
      options.quiet = true;
    } else if (a == "--stop") {
      stop = true;
    } else if (a == "--summary") {
      summaryOnly = true;
    } else if (a == "-h" || a == "--help") {
      std::fputs(kUsage, stdout);
      return 0;
    } else if (!a.empty() && a[0] == '-') {
      return usageError("unknown option " + a);
    } else {
      inputs.push_back(a);
    }
  }
  std::error_code ec;
  options.batchDir = fs::absolute(out, ec).lexically_normal();
  if (options.batchDir.filename().empty()) options.batchDir = options.batchDir.parent_path();
  const fs::path manifest = options.batchDir / "batch_jobs.tsv";

  std::vector<batch::Job> jobs;
  std::string error;
  if (stop || summaryOnly || inputs.empty()) {
    if (!inputs.empty()) return usageError("--stop and --summary take no job files");
    if (!batch::readManifest(manifest, jobs, error)) {
      std::fprintf(stderr, "stripmap_batch: %s (no earlier batch in %s)\n", error.c_str(),
                   options.batchDir.c_str());
      return 2;
    }
  } else if (!batch::collectJobs(inputs, options.batchDir, jobs, error)) {
    std::fprintf(stderr, "stripmap_batch: %s\n", error.c_str());
    return 2;
  }

  if (stop) {
    // Queued scenes must not start; running ones stop at their next progress
    // update, as when a host writes the stop value.
    std::ofstream(batch::stopFile(options.batchDir)) << "stop\n";
    batch::cancelPendingSlurmTasks(options.batchDir);
    const int stopped = batch::stopRunningScenes(jobs);
    std::printf("stop value written for %d running scene%s of %s\n", stopped, stopped == 1 ? "" : "s",
                options.batchDir.c_str());
    return 0;
  }
  if (summaryOnly) {
    batch::completeFromAccounting(jobs);
    return batch::writeSummary(jobs, options.batchDir, options.quiet) == 0 ? 0 : 1;
  }

  fs::create_directories(options.batchDir / "work", ec);
  if (ec) {
    std::fprintf(stderr, "stripmap_batch: cannot create %s: %s\n", options.batchDir.c_str(),
                 ec.message().c_str());
    return 2;
  }
  // One batch process per batch folder.
  const int lock = open((options.batchDir / ".lock").c_str(), O_RDWR | O_CREAT, 0644);
  if (lock < 0 || flock(lock, LOCK_EX | LOCK_NB) != 0) {
    std::fprintf(stderr, "stripmap_batch: another stripmap_batch is running on %s\n",
                 options.batchDir.c_str());
    return 2;
  }
  if (access(options.focuser.c_str(), X_OK) != 0) {
    std::fprintf(stderr, "stripmap_batch: the focuser %s cannot be run\n", options.focuser.c_str());
    return 2;
  }
  if (!batch::writeManifest(manifest, jobs, error)) {
    std::fprintf(stderr, "stripmap_batch: %s\n", error.c_str());
    return 2;
  }
  fs::remove(batch::stopFile(options.batchDir), ec);

  const std::vector<batch::Job> selected = batch::scenesToRun(jobs, options.all);
  if (!options.quiet && selected.size() < jobs.size())
    std::printf("%zu of %zu scenes have their product already; running the other %zu\n",
                jobs.size() - selected.size(), jobs.size(), selected.size());
  if (!selected.empty()) {
    if (slurm) {
      if (batch::runSlurm(jobs, selected, options, error) != 0) {
        std::fprintf(stderr, "stripmap_batch: %s\n", error.c_str());
        return 2;
      }
      if (!options.wait) return 0;
    } else {
      const int parallel = options.parallel > 0
                               ? options.parallel
                               : batch::automaticParallelRuns(selected, options.memoryMarginMb);
      if (!options.quiet)
        std::printf("running %zu scene%s, %d at a time, in %s\n", selected.size(),
                    selected.size() == 1 ? "" : "s", parallel, options.batchDir.c_str());
      options.threadsPerRun = std::max(1, batch::usableCores() / parallel);
      batch::runLocal(selected, options, parallel);
    }
  }
  return batch::writeSummary(jobs, options.batchDir, options.quiet) == 0 ? 0 : 1;
}
