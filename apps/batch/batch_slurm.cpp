// Slurm runs of a batch: one job array whose tasks are the scenes, each task
// this program in its task mode (it starts the focuser on the node as a host
// does and records exit, wall time and peak memory); chained arrays rerun the
// failed ones. The batch folder must be visible from the compute nodes.
#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <fstream>
#include <set>
#include <sstream>
#include <thread>

#include "batch/batch_report.h"
#include "batch/batch_run.h"

namespace batch {

namespace {

// Runs a command found on PATH and collects its standard output and error.
bool runCommand(const std::vector<std::string>& args, std::string& output, int& status) {
  output.clear();
  status = -1;
  int pipeEnds[2];
  if (pipe(pipeEnds) != 0) return false;
  std::vector<char*> argv;
  std::vector<std::string> copy = args;
  for (std::string& a : copy) argv.push_back(a.data());
  argv.push_back(nullptr);
  const pid_t pid = fork();
  if (pid < 0) {
    close(pipeEnds[0]);
    close(pipeEnds[1]);
    return false;
  }
  if (pid == 0) {
    dup2(pipeEnds[1], STDOUT_FILENO);
    dup2(pipeEnds[1], STDERR_FILENO);
    close(pipeEnds[0]);
    close(pipeEnds[1]);
    const int in = open("/dev/null", O_RDONLY);
    if (in >= 0) dup2(in, STDIN_FILENO);
    execvp(argv[0], argv.data());
    _exit(127);
  }
  close(pipeEnds[1]);
  char buffer[4096];
  for (;;) {
    const ssize_t n = read(pipeEnds[0], buffer, sizeof buffer);
    if (n > 0) output.append(buffer, static_cast<std::size_t>(n));
    else if (n == 0 || errno != EINTR) break;
  }
  close(pipeEnds[0]);
  int wstatus = 0;
  while (waitpid(pid, &wstatus, 0) < 0 && errno == EINTR) {
  }
  status = WIFEXITED(wstatus) ? WEXITSTATUS(wstatus) : 128 + WTERMSIG(wstatus);
  return status != 127;
}

std::string trim(std::string text) {
  while (!text.empty() && std::isspace(static_cast<unsigned char>(text.back()))) text.pop_back();
  std::size_t first = 0;
  while (first < text.size() && std::isspace(static_cast<unsigned char>(text[first]))) ++first;
  return text.substr(first);
}

// Array indices as Slurm writes them: "0-3,5,7-8".
std::string taskList(const std::vector<Job>& jobs) {
  std::vector<int> indices;
  for (const Job& job : jobs) indices.push_back(job.index);
  std::sort(indices.begin(), indices.end());
  std::string tasks;
  for (std::size_t i = 0; i < indices.size();) {
    std::size_t j = i;
    while (j + 1 < indices.size() && indices[j + 1] == indices[j] + 1) ++j;
    if (!tasks.empty()) tasks += ",";
    tasks += std::to_string(indices[i]);
    if (j > i) {
      tasks += '-';
      tasks += std::to_string(indices[j]);
    }
    i = j + 1;
  }
  return tasks;
}

fs::path submittedFile(const fs::path& batchDir) { return batchDir / "slurm" / "submitted.txt"; }

std::vector<std::string> submittedIds(const fs::path& batchDir) {
  std::vector<std::string> ids;
  std::ifstream in(submittedFile(batchDir));
  std::string id;
  while (in >> id) ids.push_back(id);
  return ids;
}

std::string joined(const std::vector<std::string>& items, const char* separator) {
  std::string text;
  for (const std::string& item : items) text += (text.empty() ? "" : separator) + item;
  return text;
}

// The ids among `ids` that Slurm still has queued or running; false when
// squeue could not answer.
bool activeIds(const std::vector<std::string>& ids, std::vector<std::string>& active) {
  active.clear();
  if (ids.empty()) return true;
  std::string output;
  int status = 0;
  if (!runCommand({"squeue", "-h", "-o", "%A", "-j", joined(ids, ",")}, output, status)) return false;
  // A job that has left the controller's memory is no longer valid: it has ended.
  if (status != 0) return output.find("Invalid job id") != std::string::npos;
  std::set<std::string> seen;
  std::istringstream lines(output);
  std::string id;
  while (lines >> id)
    if (seen.insert(id).second) active.push_back(id);
  return true;
}

std::string stamp() {
  char text[32];
  const std::time_t t = std::time(nullptr);
  std::tm tm{};
  gmtime_r(&t, &tm);
  std::strftime(text, sizeof text, "%Y%m%dT%H%M%S", &tm);
  return std::string(text) + "_" + std::to_string(getpid());
}

std::string quoted(const std::string& text) {
  std::string out = "'";
  for (char c : text) out += c == '\'' ? std::string("'\\''") : std::string(1, c);
  return out + "'";
}

}  // namespace

int runSlurm(const std::vector<Job>& all, const std::vector<Job>& jobs, const Options& options,
             std::string& error) {
  std::string output;
  int status = 0;
  if (!runCommand({"sbatch", "--version"}, output, status) || status != 0) {
    error = "Slurm is not available here: sbatch cannot be run";
    return 2;
  }
  const fs::path slurmDir = options.batchDir / "slurm";
  std::error_code ec;
  fs::create_directories(slurmDir, ec);
  const std::string id = stamp();
  // The tasks read their scene from a list of their own, so that a later
  // call with other job files never changes what a queued task runs.
  const fs::path manifest = slurmDir / ("jobs_" + id + ".tsv");
  if (!writeManifest(manifest, all, error)) return 2;

  int memoryMb = 0;
  for (const Job& job : jobs) memoryMb = std::max(memoryMb, job.memoryMb + options.memoryMarginMb);
  const fs::path script = slurmDir / ("array_" + id + ".sh");
  {
    std::ofstream out(script, std::ios::trunc);
    out << "#!/bin/sh\n"
        << "# One scene of the batch " << options.batchDir.string() << " a task.\n"
        << "#SBATCH --job-name=stripmap_batch\n"
        << "#SBATCH --mem=" << memoryMb << "M\n"
        << "#SBATCH --cpus-per-task=" << options.cpusPerTask << "\n"
        << "#SBATCH --output=" << (slurmDir / "task_%A_%a.out").string() << "\n"
        << "exec " << quoted(options.self.string()) << " --task " << quoted(manifest.string())
        << " \"$SLURM_ARRAY_TASK_ID\" \"$@\"\n";
    if (!out.flush()) {
      error = "cannot write " + script.string();
      return 2;
    }
  }
  fs::permissions(script, fs::perms::owner_exec, fs::perm_options::add, ec);

  for (const Job& job : jobs)
    if (!prepareRun(job, error)) return 2;

  // A rerun while an earlier array of this batch is still queued waits for it.
  std::vector<std::string> earlier;
  activeIds(submittedIds(options.batchDir), earlier);
  std::vector<std::string> ids;
  const std::string tasks = taskList(jobs);
  for (int attempt = 0; attempt <= options.retries; ++attempt) {
    std::vector<std::string> args = {"sbatch", "--parsable", "--array=" + tasks};
    const std::vector<std::string> after = attempt == 0 ? earlier : std::vector<std::string>{ids.back()};
    if (!after.empty()) args.push_back("--dependency=afterany:" + joined(after, ":"));
    args.insert(args.end(), options.sbatchArguments.begin(), options.sbatchArguments.end());
    args.push_back(script.string());
    if (attempt > 0) args.push_back("--if-failed");
    if (!runCommand(args, output, status) || status != 0) {
      error = "sbatch refused the array: " + trim(output);
      return 2;
    }
    // --parsable prints "<id>" or "<id>;<cluster>".
    std::string jobId = trim(output);
    jobId = jobId.substr(0, jobId.find(';'));
    if (jobId.empty() || jobId.find_first_not_of("0123456789") != std::string::npos) {
      error = "sbatch gave no job id: " + trim(output);
      return 2;
    }
    ids.push_back(jobId);
    std::ofstream(submittedFile(options.batchDir), std::ios::app) << jobId << "\n";
    if (!options.quiet)
      std::printf("submitted job array %s (tasks %s, %d MB each)%s\n", jobId.c_str(), tasks.c_str(),
                  memoryMb, attempt > 0 ? ", reruns the failed tasks" : "");
  }
  std::fflush(stdout);
  if (!options.wait) return 0;

  ProgressBoard board(options.batchDir, jobs, options.quiet);
  std::set<std::string> reported;
  bool stopped = false, cancelled = false;
  int silent = 0;  // seconds without an answer from squeue
  double lastStop = 0.0;
  for (;;) {
    if (stopAsked(options.batchDir)) {
      const double t = wallClock();
      if (!stopped) {
        cancelPendingSlurmTasks(options.batchDir);
        stopped = true;
      }
      if (t - lastStop >= 1.0) {
        stopRunningScenes(jobs);
        lastStop = t;
      }
      if (stopRequests >= 2 && !cancelled) {
        std::vector<std::string> args = {"scancel"};
        args.insert(args.end(), ids.begin(), ids.end());
        runCommand(args, output, status);
        cancelled = true;
      }
    }
    for (const Job& job : jobs) {
      RunRecord record;
      if (!record.read(job.recordFile())) continue;
      if (!record.finished) {
        board.running(job, record.started);
      } else if (reported.insert(job.name + std::to_string(record.started)).second) {
        board.finished(job, record);
      }
    }
    board.flush();
    std::vector<std::string> still;
    if (activeIds(ids, still)) {
      if (still.empty()) break;
      silent = 0;
    } else if (++silent == 300) {
      std::fprintf(stderr, "stripmap_batch: squeue has not answered for 5 minutes; the summary "
                           "tells what the scenes have left so far\n");
      break;
    }
    std::this_thread::sleep_for(std::chrono::seconds(1));
  }
  // A task that left the queue without finishing its record was killed (by
  // Slurm over its memory or time limit, or with its node).
  for (const Job& job : jobs) {
    RunRecord record;
    if (!record.read(job.recordFile()) || record.finished || silent >= 300) continue;
    record.finished = true;
    record.signal = SIGKILL;
    record.wallSeconds = wallClock() - record.started;
    record.write(job.recordFile());
    if (!options.quiet)
      std::printf("%-24s killed: its task ended without its record (%s)\n", job.name.c_str(),
                  record.runner.c_str());
  }
  board.flush(true);
  completeFromAccounting(jobs);
  return 0;
}

void cancelPendingSlurmTasks(const fs::path& batchDir) {
  const std::vector<std::string> ids = submittedIds(batchDir);
  if (ids.empty()) return;
  std::vector<std::string> args = {"scancel", "--state=PENDING"};
  args.insert(args.end(), ids.begin(), ids.end());
  std::string output;
  int status = 0;
  runCommand(args, output, status);
}

void completeFromAccounting(const std::vector<Job>& jobs) {
  for (const Job& job : jobs) {
    RunRecord record;
    if (!record.read(job.recordFile()) || record.peakMemoryKb >= 0) continue;
    if (record.runner.rfind("slurm ", 0) != 0) continue;
    std::string output;
    int status = 0;
    const std::string task = record.runner.substr(6);
    if (!runCommand({"sacct", "-n", "-P", "-j", task, "--format=MaxRSS"}, output, status) || status != 0)
      continue;
    // The largest MaxRSS over the task's steps, e.g. "123456K".
    long peak = -1;
    std::istringstream lines(output);
    std::string value;
    while (std::getline(lines, value)) {
      value = trim(value);
      if (value.empty()) continue;
      double v = std::strtod(value.c_str(), nullptr);
      switch (value.back()) {
        case 'M': v *= 1024.0; break;
        case 'G': v *= 1024.0 * 1024.0; break;
        case 'K': break;
        default: v /= 1024.0;
      }
      peak = std::max(peak, static_cast<long>(v));
    }
    if (peak >= 0) {
      record.peakMemoryKb = peak;
      record.write(job.recordFile());
    }
  }
}

}  // namespace batch
