#include "host_run.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <regex>
#include <thread>

#include "files.h"

namespace support {

Job basicJob(const std::string& platform, const std::string& scene, const std::string& outputRoot) {
  Job p(24, "NotOK");
  p[0] = platform;
  p[1] = scene;
  p[5] = outputRoot;
  p[16] = "0";
  p[17] = "0";
  return p;
}

Job ersJob(const SensorScene& scene, const std::string& outputRoot) {
  Job p = basicJob("ERS", scene["image"], outputRoot);
  p[6] = scene["orbit"];
  p[7] = scene["leader"];
  p[20] = "0";
  p[21] = "0";
  p[23] = "0";
  return p;
}

Job envisatJob(const SensorScene& scene, const std::string& outputRoot) {
  Job p = basicJob("ENVISAT", scene["image"], outputRoot);
  p[11] = scene["orbit_dir"];
  p[12] = p[13] = p[14] = scene["aux_dir"];
  p[20] = p[21] = p[23] = "0";
  return p;
}

Job palsarJob(const std::string& platform, const PalsarSceneFiles& files, const std::string& outputRoot) {
  Job p(24, "NotOK");
  p[0] = platform;
  for (std::size_t k = 0; k < files.images.size() && k < 4; ++k) p[1 + k] = files.images[k];
  p[5] = outputRoot;
  p[6] = p[7] = files.leader;
  p[16] = p[17] = p[20] = p[21] = p[23] = "0";
  return p;
}

void writeJob(const std::string& file, const Job& job) {
  std::string text = "stripmap focusing job\n";
  for (const auto& p : job) text += p + "\n";
  writeText(file, text);
}

FocuserRun runFocuser(const std::string& folder, const std::string& jobFile, const RunOptions& options) {
  const std::string progress = folder + "progress.txt";
  const std::string console = folder + "stderr.txt";
  const std::string exe = options.executable.empty() ? std::string(binDir()) + "stripmap_focuser" : options.executable;
  const auto started = std::chrono::steady_clock::now();
  const pid_t pid = fork();
  if (pid == 0) {
    std::map<std::string, std::string> variables;
    if (options.hostVariables)
      variables = {{"TESSIVOR_WORKING_DIR", folder},
                   {"TESSIVOR_WORKING_FILE", progress},
                   {"TESSIVOR_CEOS_DES_FILES_DIR", resourcesDir()},
                   {"TESSIVOR_TRACING", "ACTIVE"}};
    for (const auto& [name, value] : options.variables) variables[name] = value;
    for (const char* name : {"TESSIVOR_WORKING_DIR", "TESSIVOR_WORKING_FILE", "TESSIVOR_CEOS_DES_FILES_DIR",
                             "TESSIVOR_TRACING"})
      unsetenv(name);
    for (const auto& [name, value] : variables)
      if (!value.empty()) setenv(name.c_str(), value.c_str(), 1);
    if (chdir(folder.c_str()) != 0) _exit(126);
    if (options.fileSizeLimit > 0) {
      // A write past the limit fails with EFBIG instead of killing the process.
      signal(SIGXFSZ, SIG_IGN);
      const rlimit limit{rlim_t(options.fileSizeLimit), rlim_t(options.fileSizeLimit)};
      setrlimit(RLIMIT_FSIZE, &limit);
    }
    const int fd = open(console.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
    if (fd >= 0) {
      dup2(fd, STDERR_FILENO);
      dup2(fd, STDOUT_FILENO);
    }
    const std::string command = options.command.empty() ? "main_focussing_stripmap#" + jobFile : options.command;
    execl(exe.c_str(), "stripmap_focuser", command.c_str(), static_cast<char*>(nullptr));
    _exit(127);
  }
  FocuserRun run;
  if (pid < 0) return run;
  int status = 0;
  rusage usage{};
  for (;;) {
    const pid_t done = wait4(pid, &status, WNOHANG, &usage);
    if (done == pid) break;
    if (done < 0) return run;
    if (options.hook) options.hook(RunningFocuser{pid, folder, readText(progress)});
    if (std::chrono::steady_clock::now() - started > std::chrono::seconds(options.timeoutSeconds)) {
      kill(pid, SIGKILL);
      wait4(pid, &status, 0, &usage);
      ADD_FAILURE() << "focuser still running after " << options.timeoutSeconds << " s";
      break;
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(options.pollMilliseconds));
  }
  run.seconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - started).count();
  run.cpuSeconds = usage.ru_utime.tv_sec + 1e-6 * usage.ru_utime.tv_usec + usage.ru_stime.tv_sec +
                   1e-6 * usage.ru_stime.tv_usec;
  run.peakMiB = usage.ru_maxrss / 1024.0;
  if (WIFEXITED(status)) run.exitStatus = WEXITSTATUS(status);
  run.signalled = WIFSIGNALED(status);
  run.log = readText(folder + "Process.log");
  run.trace = readText(folder + "Process.trace");
  run.errorFile = readText(progress + "_error");
  run.stderrText = readText(console);
  std::smatch m;
  if (std::regex_search(run.errorFile, m, std::regex(R"(\[EC : (\d+)\])"))) run.errorCode = std::stoi(m[1]);
  return run;
}

}  // namespace support
