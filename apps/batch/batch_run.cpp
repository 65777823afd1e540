// Local runs of a batch: the focuser started as a host starts it (command
// string, TESSIVOR_* variables, its own working folder and progress file),
// several side by side, followed and stopped through the progress files.
#include "batch/batch_run.h"

#include <fcntl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <deque>
#include <fstream>
#include <map>
#include <thread>

#include "batch/batch_report.h"

extern char** environ;

namespace batch {

volatile std::sig_atomic_t stopRequests = 0;

namespace {

void onStopSignal(int) { stopRequests = stopRequests + 1; }

std::string hostName() {
  char name[256] = {};
  if (gethostname(name, sizeof name - 1) != 0) return "?";
  return name;
}

// Starts the focuser on the job exactly as a host does: the command string
// "main_focussing_stripmap#<job file>" as its only argument, the working
// folder and progress file of the scene in TESSIVOR_WORKING_DIR and
// TESSIVOR_WORKING_FILE, the working folder as its current folder (the
// focuser writes some of its files there), its output into a file of the
// folder. The child leads a process group of its own, so that a Ctrl-C on
// the terminal reaches the batch, which stops the runs through their
// progress files, and not the runs themselves.
pid_t startFocuser(const Job& job, const Options& options, std::string& error) {
  std::vector<std::string> environment;
  for (char** e = environ; *e; ++e) {
    const std::string entry = *e;
    if (entry.rfind("TESSIVOR_WORKING_DIR=", 0) == 0 || entry.rfind("TESSIVOR_WORKING_FILE=", 0) == 0)
      continue;
    environment.push_back(entry);
  }
  // Runs side by side share the cores instead of each taking all of them.
  if (options.threadsPerRun > 0) {
    for (const char* name : {"TESSIVOR_FFT_THREADS", "OMP_NUM_THREADS"})
      if (!std::getenv(name)) environment.push_back(std::string(name) + "=" + std::to_string(options.threadsPerRun));
  }
  environment.push_back("TESSIVOR_WORKING_DIR=" + job.workDir.string() + "/");
  environment.push_back("TESSIVOR_WORKING_FILE=" + job.progressFile().string());
  std::vector<char*> envp;
  for (std::string& e : environment) envp.push_back(e.data());
  envp.push_back(nullptr);
  std::string program = options.focuser.string();
  std::string name = "stripmap_focuser";
  std::string command = "main_focussing_stripmap#" + job.jobFile.string();
  char* argv[] = {name.data(), command.data(), nullptr};
  const std::string workDir = job.workDir.string();
  const std::string output = job.outputFile().string();

  const pid_t pid = fork();
  if (pid < 0) {
    error = std::string("cannot start a process: ") + std::strerror(errno);
    return -1;
  }
  if (pid == 0) {
    setpgid(0, 0);
    signal(SIGINT, SIG_DFL);
    signal(SIGTERM, SIG_DFL);
    if (chdir(workDir.c_str()) != 0) _exit(126);
    const int in = open("/dev/null", O_RDONLY);
    const int out = open(output.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
    if (in < 0 || out < 0) _exit(126);
    dup2(in, STDIN_FILENO);
    dup2(out, STDOUT_FILENO);
    dup2(out, STDERR_FILENO);
    execve(program.c_str(), argv, envp.data());
    _exit(127);
  }
  setpgid(pid, pid);
  return pid;
}

// Record of a run that has just started.
RunRecord startedRecord(double started, const std::string& runner) {
  RunRecord r;
  r.present = true;
  r.started = started;
  r.host = hostName();
  r.runner = runner;
  return r;
}

// Completes the record of an ended run from its wait status and usage.
void finishRecord(RunRecord& r, int status, const rusage& usage) {
  r.finished = true;
  r.wallSeconds = wallClock() - r.started;
  r.peakMemoryKb = usage.ru_maxrss;  // kilobytes on Linux
  if (WIFEXITED(status)) {
    r.exitStatus = WEXITSTATUS(status);
  } else if (WIFSIGNALED(status)) {
    r.signal = WTERMSIG(status);
  }
}

struct Running {
  const Job* job = nullptr;
  RunRecord record;
  double lastStop = 0.0;
};

}  // namespace

void installStopHandlers() {
  struct sigaction action {};
  action.sa_handler = onStopSignal;
  sigemptyset(&action.sa_mask);
  sigaction(SIGINT, &action, nullptr);
  sigaction(SIGTERM, &action, nullptr);
}

fs::path stopFile(const fs::path& batchDir) { return batchDir / "STOP"; }

bool stopAsked(const fs::path& batchDir) {
  std::error_code ec;
  return stopRequests > 0 || fs::exists(stopFile(batchDir), ec);
}

std::vector<Job> scenesToRun(const std::vector<Job>& jobs, bool all) {
  std::vector<Job> selected;
  for (const Job& job : jobs) {
    RunRecord record;
    record.read(job.recordFile());
    const SceneState state = sceneState(job, record, readErrorReport(job.errorFile()));
    if (all || state != SceneState::Success) selected.push_back(job);
  }
  return selected;
}

int usableCores() {
  int cores = static_cast<int>(std::thread::hardware_concurrency());
  cpu_set_t set;
  if (sched_getaffinity(0, sizeof set, &set) == 0) cores = CPU_COUNT(&set);
  return std::max(cores, 1);
}

int automaticParallelRuns(const std::vector<Job>& jobs, int marginMb) {
  const int cores = usableCores();
  long availableMb = 0;
  std::ifstream meminfo("/proc/meminfo");
  std::string key;
  long value = 0;
  std::string unit;
  while (meminfo >> key >> value >> unit) {
    if (key == "MemAvailable:") {
      availableMb = value / 1024;
      break;
    }
  }
  int request = 0;
  for (const Job& job : jobs) request = std::max(request, job.memoryMb + marginMb);
  if (availableMb <= 0 || request <= 0) return cores;
  const long byMemory = availableMb / request;
  return static_cast<int>(std::clamp<long>(byMemory, 1, cores));
}

int stopRunningScenes(const std::vector<Job>& jobs) {
  int stopped = 0;
  for (const Job& job : jobs) {
    RunRecord record;
    if (record.read(job.recordFile()) && !record.finished && writeStopValue(job)) ++stopped;
  }
  return stopped;
}

void runLocal(const std::vector<Job>& jobs, const Options& options, int parallel) {
  std::deque<const Job*> queue;
  for (const Job& job : jobs) queue.push_back(&job);
  std::map<pid_t, Running> running;
  ProgressBoard board(options.batchDir, jobs, options.quiet);
  bool killed = false;
  while (!queue.empty() || !running.empty()) {
    const bool stop = stopAsked(options.batchDir);
    if (stop && !queue.empty()) {
      for (const Job* job : queue) board.note(*job, "not started: the batch was stopped");
      queue.clear();
    }
    if (stop) {
      // Written again every second: a run that was rewriting its progress
      // file at the same moment may have put its own percentage back.
      for (auto& [pid, run] : running) {
        if (wallClock() - run.lastStop < 1.0) continue;
        writeStopValue(*run.job);
        run.lastStop = wallClock();
      }
      if (stopRequests >= 2 && !killed) {
        for (auto& [pid, run] : running) kill(-pid, SIGKILL);
        killed = true;
      }
    }
    while (!stop && static_cast<int>(running.size()) < parallel && !queue.empty()) {
      const Job* job = queue.front();
      queue.pop_front();
      std::string error;
      Running run;
      run.job = job;
      run.record = startedRecord(wallClock(), "local");
      if (!prepareRun(*job, error) || !run.record.write(job->recordFile())) {
        board.note(*job, error.empty() ? "cannot write its run record" : error);
        continue;
      }
      const pid_t pid = startFocuser(*job, options, error);
      if (pid < 0) {
        board.note(*job, error);
        std::error_code ec;
        fs::remove(job->recordFile(), ec);
        continue;
      }
      running.emplace(pid, std::move(run));
    }
    for (;;) {
      int status = 0;
      rusage usage{};
      const pid_t pid = wait4(-1, &status, WNOHANG, &usage);
      if (pid <= 0) break;
      auto it = running.find(pid);
      if (it == running.end()) continue;
      finishRecord(it->second.record, status, usage);
      it->second.record.write(it->second.job->recordFile());
      board.finished(*it->second.job, it->second.record);
      running.erase(it);
    }
    for (const auto& [pid, run] : running) board.running(*run.job, run.record.started);
    board.flush();
    if (!queue.empty() || !running.empty()) std::this_thread::sleep_for(std::chrono::milliseconds(200));
  }
  board.flush(true);
}

int runTask(const Job& job, const Options& options, bool onlyIfFailed) {
  if (stopAsked(options.batchDir)) return 0;
  RunRecord previous;
  previous.read(job.recordFile());
  if (onlyIfFailed &&
      sceneState(job, previous, readErrorReport(job.errorFile())) == SceneState::Success)
    return 0;
  std::string runner = "slurm";
  const char* arrayJob = std::getenv("SLURM_ARRAY_JOB_ID");
  const char* task = std::getenv("SLURM_ARRAY_TASK_ID");
  if (arrayJob && task) runner += std::string(" ") + arrayJob + "_" + task;
  RunRecord record = startedRecord(wallClock(), runner);
  std::string error;
  if (!prepareRun(job, error) || !record.write(job.recordFile())) {
    std::fprintf(stderr, "stripmap_batch: %s: %s\n", job.name.c_str(),
                 error.empty() ? "cannot write its run record" : error.c_str());
    return 1;
  }
  const pid_t pid = startFocuser(job, options, error);
  if (pid < 0) {
    std::fprintf(stderr, "stripmap_batch: %s: %s\n", job.name.c_str(), error.c_str());
    std::error_code ec;
    fs::remove(job.recordFile(), ec);
    return 1;
  }
  int status = 0;
  rusage usage{};
  bool stopWritten = false;
  for (;;) {
    const pid_t done = wait4(pid, &status, WNOHANG, &usage);
    if (done < 0 && errno == EINTR) continue;
    if (done == pid || done < 0) break;
    if (!stopWritten && stopAsked(options.batchDir)) stopWritten = writeStopValue(job);
    std::this_thread::sleep_for(std::chrono::milliseconds(200));
  }
  finishRecord(record, status, usage);
  record.write(job.recordFile());
  return sceneState(job, record, readErrorReport(job.errorFile())) == SceneState::Success ? 0 : 1;
}

}  // namespace batch
