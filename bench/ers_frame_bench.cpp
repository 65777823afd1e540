// Whole-chain speed on a full ERS frame (28,000 lines x 5,616 samples):
// the raw scene is simulated once into a cache folder, then the focuser is
// run on it as the host runs it (variables, command string, progress file)
// and the wall and CPU time of every stage are reported beside the floor of
// the stage measured in the same run (see frame_harness.h).
//   TESSIVOR_BENCH_CACHE   cache folder (default <build>/bench-cache/ers_frame)
//   TESSIVOR_BENCH_FOCUSER focuser executable (default next to this one)
#include <benchmark/benchmark.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <string>

#include "frame_harness.h"
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

const std::vector<frame_bench::Stage> kStages = frame_bench::chainStages("ERS image extracted");

// One run on the cached scene: the orbit arc looked up in the archive, the
// whole scene, temporary files erased.
frame_bench::FrameRun runFrame(const std::string& cache, const support::SensorScene& files) {
  const std::string run = cache + "run/";
  fs::remove_all(run);
  fs::create_directories(run);
  support::Job job = support::ersJob(files, run + "frame");
  job[6] = "NotOK";
  job[11] = files["orbit_archive"];
  job[18] = "1";
  support::writeJob(run + "job.txt", job);
  return frame_bench::runFrame(run, run + "job.txt", kStages, frame_bench::focuserPath());
}

void BM_ErsFrame(benchmark::State& state) {
  const std::string cache = frame_bench::cacheDir("ers_frame");
  support::SensorScene files;
  std::string error;
  if (!ensureScene(cache, files, error)) {
    state.SkipWithError(("simulation failed: " + error).c_str());
    return;
  }
  const double budget = frame_bench::profileMemoryMiB(support::resourcesDir() + std::string("parameters_ERS.hdr"));
  frame_bench::reportFrame(state, kStages, budget, "28000 x 5616 ERS frame, CEOS files to SLC",
                           [&] { return runFrame(cache, files); });
}
BENCHMARK(BM_ErsFrame)->Unit(benchmark::kSecond)->UseManualTime()->Iterations(1);

}  // namespace

BENCHMARK_MAIN();
