// Whole-chain speed on a full ERS frame (28,000 lines x 5,616 samples):
// the raw scene is simulated once into a cache folder, then the focuser is
// run on it as the host runs it (variables, command string, progress file)
// and the wall and CPU time of every stage are reported. Stage limits are
// the checkpoints of Process.trace, seen by polling the growing trace; the
// CPU time of the running process is read from /proc at each checkpoint.
//   TESSIVOR_BENCH_CACHE   cache folder (default <build>/bench-cache/ers_frame)
//   TESSIVOR_BENCH_FOCUSER focuser executable (default next to this one)
#include <benchmark/benchmark.h>

#include <fcntl.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "sim/raw_scene.h"

namespace {

namespace fs = std::filesystem;

constexpr int kLines = 28000;
constexpr int kSamples = 5616;

SceneDescription frameScene() {
  SceneDescription s;
  s.mission = "ERS2";
  s.orbit.semiMajorAxis = 7159500.0;
  s.orbit.eccentricity = 0.0011;
  s.orbit.inclinationDeg = 98.52;
  s.orbit.nodeLongitudeDeg = 0.0;
  s.orbit.argPerigeeDeg = 90.0;
  s.orbit.meanAnomalyDeg = -50.0;
  double start = 0.0;
  simParseDate("18-JAN-2010 17:49:28.683", start);
  s.orbit.epoch = start;
  s.startTime = start;
  s.lines = kLines;
  s.samples = kSamples;
  s.nearRangeTime = 0.00555;
  s.dopplerCentroidHz = 250.0;
  s.orbitNumber = 77106;
  s.frame = 2925;
  s.arcNumber = 123;
  s.sceneDir = "ERS2_FRAME";
  for (int i = 0; i < 8; ++i)
    s.pixelTargets.push_back({3000.0 + 3000.0 * i + 0.25, 400.0 + 650.0 * i + 0.5, 20.0 * (i % 3), 4.0});
  s.clutterSigma = 2.0;
  s.noiseSigma = 1.0;
  s.seed = 17;
  return s;
}

std::string readText(const std::string& file) {
  std::ifstream in(file, std::ios::binary);
  std::stringstream s;
  s << in.rdbuf();
  return s.str();
}

fs::path executableDir() { return fs::read_symlink("/proc/self/exe").parent_path(); }

fs::path cacheDir() {
  if (const char* c = std::getenv("TESSIVOR_BENCH_CACHE")) return c;
  return executableDir().parent_path() / "bench-cache" / "ers_frame";
}

std::string focuserPath() {
  if (const char* f = std::getenv("TESSIVOR_BENCH_FOCUSER")) return f;
  return (executableDir() / "stripmap_focuser").string();
}

// Simulates the frame unless the cache already holds it.
bool ensureScene(const fs::path& cache, std::string& error) {
  const SceneDescription scene = frameScene();
  const fs::path stamp = cache / "sim.done";
  const std::string key = "ers frame " + std::to_string(kLines) + "x" + std::to_string(kSamples) + " seed " +
                          std::to_string(scene.seed) + " targets " + std::to_string(scene.pixelTargets.size()) + "\n";
  if (fs::exists(stamp) && readText(stamp.string()) == key) return true;
  fs::remove_all(cache / "sim");
  fs::create_directories(cache);
  try {
    const RawSceneSimulator sim(scene);
    if (sim.writeErsScene((cache / "sim").string(), error) != 0) return false;
  } catch (const std::exception& e) {
    error = e.what();
    return false;
  }
  std::ofstream(stamp) << key;
  return true;
}

// CPU seconds (user + system, all threads) of a running process.
double processCpu(pid_t pid) {
  const std::string stat = readText("/proc/" + std::to_string(pid) + "/stat");
  const std::size_t close = stat.rfind(')');
  if (close == std::string::npos) return -1.0;
  std::istringstream in(stat.substr(close + 2));
  std::string field;
  unsigned long long utime = 0, stime = 0;
  // Fields after the name: state is field 3; utime and stime are 14 and 15.
  for (int f = 3; f <= 15 && in >> field; ++f) {
    if (f == 14) utime = std::stoull(field);
    if (f == 15) stime = std::stoull(field);
  }
  return static_cast<double>(utime + stime) / static_cast<double>(sysconf(_SC_CLK_TCK));
}

struct Stage {
  const char* name;
  const char* endMarker;  // checkpoint closing the stage; nullptr: process exit
};
constexpr std::array<Stage, 8> kStages{{
    {"setup", "Starting ingestion"},
    {"extraction", "ERS image extracted"},
    {"preparation", "CHECKPOINT: Range Focusing"},
    {"range_focusing", "CHECKPOINT: DC Estimation"},
    {"doppler", "CHECKPOINT: GEOMETRIC POLYNOMIALS COMPUTATION"},
    {"geometry", "CHECKPOINT: Azimuth Focusing"},
    {"azimuth_focusing", "CHECKPOINT: Writing headers"},
    {"finishing", nullptr},
}};

struct RunTimes {
  int status = -1;
  std::array<double, kStages.size()> wall{}, cpu{};
  double totalWall = 0.0, totalCpu = 0.0, peakMiB = 0.0;
  std::string message;
};

void writeJob(const fs::path& sim, const fs::path& run, const fs::path& job) {
  // The 24 positional parameters: platform, scene, output root, leader,
  // orbit folder (the arc is looked up), whole scene, erase temporaries.
  const std::string n = "NotOK";
  const std::vector<std::string> p = {
      "ERS", (sim / "ERS2_FRAME" / "DAT_01.001").string(), n, n, n, (run / "frame").string(), n,
      (sim / "ERS2_FRAME" / "LEA_01.001").string(), n, n, n, (sim / "orbits").string(), n, n, n, n,
      "0", "0", "1", n, "0", "0", n, "0"};
  std::ofstream out(job);
  out << "ers frame benchmark\n";
  for (const auto& v : p) out << v << "\n";
}

RunTimes runFocuser(const fs::path& cache) {
  RunTimes t;
  const fs::path run = cache / "run";
  fs::remove_all(run);
  fs::create_directories(run);
  const fs::path job = run / "job.txt";
  writeJob(cache / "sim", run, job);
  const std::string folder = run.string() + "/";
  const std::string trace = folder + "Process.trace";
  const std::string exe = focuserPath();
  const std::string command = "main_focussing_stripmap#" + job.string();

  const auto started = std::chrono::steady_clock::now();
  const pid_t pid = fork();
  if (pid == 0) {
    setenv("TESSIVOR_WORKING_DIR", folder.c_str(), 1);
    setenv("TESSIVOR_WORKING_FILE", (folder + "progress.txt").c_str(), 1);
    setenv("TESSIVOR_CEOS_DES_FILES_DIR", TESSIVOR_DEFAULT_RESOURCE_DIR, 1);
    setenv("TESSIVOR_TRACING", "ACTIVE", 1);
    if (chdir(folder.c_str()) != 0) _exit(126);
    const int fd = open((folder + "console.txt").c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
    if (fd >= 0) {
      dup2(fd, STDOUT_FILENO);
      dup2(fd, STDERR_FILENO);
    }
    execl(exe.c_str(), "stripmap_focuser", command.c_str(), static_cast<char*>(nullptr));
    _exit(127);
  }
  if (pid < 0) {
    t.message = "fork failed";
    return t;
  }

  auto seconds = [&] {
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - started).count();
  };
  std::size_t next = 0;  // next stage whose end is awaited
  double lastWall = 0.0, lastCpu = 0.0;
  int status = 0;
  rusage usage{};
  for (;;) {
    if (next + 1 < kStages.size()) {
      const double cpu = processCpu(pid);
      const std::string text = readText(trace);
      while (next + 1 < kStages.size() && text.find(kStages[next].endMarker) != std::string::npos) {
        const double wall = seconds();
        t.wall[next] = wall - lastWall;
        t.cpu[next] = cpu >= 0.0 ? cpu - lastCpu : 0.0;
        lastWall = wall;
        if (cpu >= 0.0) lastCpu = cpu;
        ++next;
      }
    }
    const pid_t done = wait4(pid, &status, WNOHANG, &usage);
    if (done == pid) break;
    if (done < 0) {
      t.message = "wait failed";
      return t;
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
  }
  t.totalWall = seconds();
  t.totalCpu = usage.ru_utime.tv_sec + 1e-6 * usage.ru_utime.tv_usec + usage.ru_stime.tv_sec +
               1e-6 * usage.ru_stime.tv_usec;
  t.peakMiB = usage.ru_maxrss / 1024.0;
  t.wall[kStages.size() - 1] = t.totalWall - lastWall;
  t.cpu[kStages.size() - 1] = t.totalCpu - lastCpu;
  t.status = WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
  if (t.status != 0 || fs::exists(folder + "progress.txt_error"))
    t.message = "focuser failed (status " + std::to_string(t.status) + "), see " + folder + "Process.log";
  else if (next + 1 < kStages.size()) {
    t.message = "checkpoint not found in the trace: ";
    t.message += kStages[next].endMarker;
  }
  return t;
}

void BM_ErsFrame(benchmark::State& state) {
  const fs::path cache = cacheDir();
  std::string error;
  if (!ensureScene(cache, error)) {
    state.SkipWithError(("simulation failed: " + error).c_str());
    return;
  }
  RunTimes sum;
  int runs = 0;
  for (auto _ : state) {
    const RunTimes t = runFocuser(cache);
    if (!t.message.empty()) {
      state.SkipWithError(t.message.c_str());
      return;
    }
    for (std::size_t i = 0; i < kStages.size(); ++i) {
      sum.wall[i] += t.wall[i];
      sum.cpu[i] += t.cpu[i];
    }
    sum.totalWall += t.totalWall;
    sum.totalCpu += t.totalCpu;
    sum.peakMiB = std::max(sum.peakMiB, t.peakMiB);
    ++runs;
    state.SetIterationTime(t.totalWall);
  }
  if (runs == 0) return;
  std::fprintf(stderr, "\n%-18s %9s %9s\n", "stage", "wall s", "cpu s");
  for (std::size_t i = 0; i < kStages.size(); ++i) {
    const double w = sum.wall[i] / runs, c = sum.cpu[i] / runs;
    std::fprintf(stderr, "%-18s %9.2f %9.2f\n", kStages[i].name, w, c);
    std::string name = kStages[i].name;
    state.counters[name + "_wall"] = w;
    name += "_cpu";
    state.counters[name] = c;
  }
  std::fprintf(stderr, "%-18s %9.2f %9.2f   peak %.0f MiB\n\n", "total", sum.totalWall / runs,
               sum.totalCpu / runs, sum.peakMiB);
  state.counters["total_wall"] = sum.totalWall / runs;
  state.counters["total_cpu"] = sum.totalCpu / runs;
  state.counters["peak_MiB"] = sum.peakMiB;
  state.SetLabel("28000 x 5616 ERS frame, CEOS files to SLC");
}
BENCHMARK(BM_ErsFrame)->Unit(benchmark::kSecond)->UseManualTime()->Iterations(1);

}  // namespace

BENCHMARK_MAIN();
