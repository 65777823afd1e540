// Whole-chain speed on a full ERS frame (28,000 lines x 5,616 samples):
// the raw scene is simulated once into a cache folder, then the focuser is
// run on it as the host runs it (variables, command string, progress file)
// and the wall and CPU time of every stage are reported. Stage limits are
// the checkpoints of Process.trace, seen by polling the growing trace; the
// CPU time of the running process is read from /proc at each checkpoint.
//   TESSIVOR_BENCH_CACHE   cache folder (default <build>/bench-cache/ers_frame)
//   TESSIVOR_BENCH_FOCUSER focuser executable (default next to this one)
#include <benchmark/benchmark.h>
#include <unistd.h>

#include <array>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>

#include "support/files.h"
#include "support/host_run.h"
#include "support/scenes.h"

namespace {

namespace fs = std::filesystem;
using support::readText;

constexpr int kLines = 28000;
constexpr int kSamples = 5616;

SceneDescription frameScene() {
  SceneDescription s = support::ersScene(kLines, kSamples, 250.0);
  s.sceneDir = "ERS2_FRAME";
  for (int i = 0; i < 8; ++i)
    s.pixelTargets.push_back({3000.0 + 3000.0 * i + 0.25, 400.0 + 650.0 * i + 0.5, 20.0 * (i % 3), 4.0});
  s.seed = 17;
  return s;
}

fs::path executableDir() { return fs::read_symlink("/proc/self/exe").parent_path(); }

std::string cacheDir() {
  if (const char* c = std::getenv("TESSIVOR_BENCH_CACHE")) return std::string(c) + "/";
  return (executableDir().parent_path() / "bench-cache" / "ers_frame").string() + "/";
}

std::string focuserPath() {
  if (const char* f = std::getenv("TESSIVOR_BENCH_FOCUSER")) return f;
  return (executableDir() / "stripmap_focuser").string();
}

// Simulates the frame unless the cache already holds it.
bool ensureScene(const std::string& cache, support::SensorScene& files, std::string& error) {
  const SceneDescription scene = frameScene();
  const std::string stamp = cache + "sim.done";
  const std::string key = "ers frame " + std::to_string(kLines) + "x" + std::to_string(kSamples) + " seed " +
                          std::to_string(scene.seed) + " targets " + std::to_string(scene.pixelTargets.size()) + "\n";
  try {
    files = support::ersSceneFiles(RawSceneSimulator(scene), cache);
  } catch (const std::exception& e) {
    error = e.what();
    return false;
  }
  if (fs::exists(stamp) && readText(stamp) == key) return true;
  fs::remove_all(cache + "sim");
  fs::create_directories(cache);
  if (!support::simulateErs(scene, cache, files, error)) return false;
  support::writeText(stamp, key);
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
  std::array<double, kStages.size()> wall{}, cpu{};
  double totalWall = 0.0, totalCpu = 0.0, peakMiB = 0.0;
  std::string message;
};

// One run on the cached scene: the orbit arc looked up in the archive, the
// whole scene, temporary files erased.
RunTimes runFrame(const std::string& cache, const support::SensorScene& files) {
  RunTimes t;
  const std::string run = cache + "run/";
  fs::remove_all(run);
  fs::create_directories(run);
  support::Job job = support::ersJob(files, run + "frame");
  job[6] = "NotOK";
  job[11] = files["orbit_archive"];
  job[18] = "1";
  support::writeJob(run + "job.txt", job);

  std::size_t next = 0;  // next stage whose end is awaited
  double lastWall = 0.0, lastCpu = 0.0;
  const auto started = std::chrono::steady_clock::now();
  support::RunOptions options;
  options.executable = focuserPath();
  options.pollMilliseconds = 5;
  options.timeoutSeconds = 7200;
  options.hook = [&](const support::RunningFocuser& running) {
    if (next + 1 >= kStages.size()) return;
    const double cpu = processCpu(running.pid);
    const std::string text = readText(running.folder + "Process.trace");
    while (next + 1 < kStages.size() && text.find(kStages[next].endMarker) != std::string::npos) {
      const double wall = std::chrono::duration<double>(std::chrono::steady_clock::now() - started).count();
      t.wall[next] = wall - lastWall;
      t.cpu[next] = cpu >= 0.0 ? cpu - lastCpu : 0.0;
      lastWall = wall;
      if (cpu >= 0.0) lastCpu = cpu;
      ++next;
    }
  };
  const support::FocuserRun r = support::runFocuser(run, run + "job.txt", options);
  t.totalWall = r.seconds;
  t.totalCpu = r.cpuSeconds;
  t.peakMiB = r.peakMiB;
  t.wall[kStages.size() - 1] = t.totalWall - lastWall;
  t.cpu[kStages.size() - 1] = t.totalCpu - lastCpu;
  if (r.exitStatus != 0 || r.errorCode != 0)
    t.message = "focuser failed (status " + std::to_string(r.exitStatus) + "), see " + run + "Process.log";
  else if (next + 1 < kStages.size())
    t.message = std::string("checkpoint not found in the trace: ") + kStages[next].endMarker;
  return t;
}

void BM_ErsFrame(benchmark::State& state) {
  const std::string cache = cacheDir();
  support::SensorScene files;
  std::string error;
  if (!ensureScene(cache, files, error)) {
    state.SkipWithError(("simulation failed: " + error).c_str());
    return;
  }
  RunTimes sum;
  int runs = 0;
  for (auto _ : state) {
    const RunTimes t = runFrame(cache, files);
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
