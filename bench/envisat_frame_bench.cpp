// Whole-chain speed on a full ASAR image-mode frame (IS2, 28,000 lines x
// 5,600 samples), with the same stage and floor report as the ERS frame:
// the level-0 product is simulated once into a cache folder, then the
// focuser runs on it as the host runs it.
//   TESSIVOR_BENCH_CACHE   cache folder (default <build>/bench-cache/envisat_frame)
//   TESSIVOR_BENCH_FOCUSER focuser executable (default next to this one)
#include <benchmark/benchmark.h>

#include <filesystem>
#include <sstream>
#include <string>

#include "frame_harness.h"
#include "support/files.h"
#include "support/host_run.h"
#include "support/scenes.h"

namespace {

namespace fs = std::filesystem;

constexpr int kLines = 28000;
constexpr int kSamples = 5600;

SceneDescription frameScene(const AsarSimConfig& cfg) {
  SceneDescription s = support::envisatScene(cfg, kLines, kSamples, 250.0);
  for (int i = 0; i < 8; ++i)
    s.pixelTargets.push_back({3000.0 + 3000.0 * i + 0.25, 400.0 + 650.0 * i + 0.5, 20.0 * (i % 3), 4.0});
  s.seed = 23;
  return s;
}

// Simulates the frame unless the cache already holds it.
bool ensureScene(const std::string& cache, support::SensorScene& files, std::string& error) {
  const AsarSimConfig cfg;
  const SceneDescription scene = frameScene(cfg);
  const std::string stamp = cache + "sim.done";
  const std::string key = "asar im frame " + std::to_string(kLines) + "x" + std::to_string(kSamples) + " seed " +
                          std::to_string(scene.seed) + "\n";
  if (fs::exists(stamp) && support::readText(stamp) == key && fs::exists(cache + "files.txt")) {
    std::istringstream in(support::readText(cache + "files.txt"));
    std::string role, path;
    while (in >> role >> path) files.files[role] = path;
    files.root = cache + "sim";
    return true;
  }
  fs::remove_all(cache + "sim");
  fs::create_directories(cache);
  if (!support::simulateEnvisat(scene, cfg, cache, files, error)) return false;
  std::string list;
  for (const auto& [role, path] : files.files) list += role + " " + path + "\n";
  support::writeText(cache + "files.txt", list);
  support::writeText(stamp, key);
  return true;
}

const std::vector<frame_bench::Stage> kStages = frame_bench::chainStages("Extraction completed");

void BM_EnvisatFrame(benchmark::State& state) {
  const std::string cache = frame_bench::cacheDir("envisat_frame");
  support::SensorScene files;
  std::string error;
  if (!ensureScene(cache, files, error)) {
    state.SkipWithError(("simulation failed: " + error).c_str());
    return;
  }
  const double budget =
      frame_bench::profileMemoryMiB(support::resourcesDir() + std::string("parameters_ENVISAT.hdr"));
  frame_bench::reportFrame(state, kStages, budget, "28000 x 5600 ASAR IM frame, level 0 to SLC", [&] {
    const std::string run = cache + "run/";
    fs::remove_all(run);
    fs::create_directories(run);
    support::Job job = support::envisatJob(files, run + "frame");
    job[18] = "1";
    support::writeJob(run + "job.txt", job);
    return frame_bench::runFrame(run, run + "job.txt", kStages, frame_bench::focuserPath());
  });
}
BENCHMARK(BM_EnvisatFrame)->Unit(benchmark::kSecond)->UseManualTime()->Iterations(1);

}  // namespace

BENCHMARK_MAIN();
