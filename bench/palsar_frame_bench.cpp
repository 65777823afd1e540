// Whole-chain speed on a full ALOS PALSAR fine-beam single-polarisation
// frame (FBS, JAXA layout, 18,432 lines x 10,000 samples) with interference
// removal on, with the same stage and floor report as the ERS frame: the
// level-1.0 product (two persistent tones and two single-line bursts over
// the clutter) is simulated once into a cache folder, then the focuser runs
// on it as the host runs it, with the PALSAR profile's
// `Remove_interferences` set to 1 in a copy of the resource folder.
//   TESSIVOR_BENCH_CACHE   cache folder (default <build>/bench-cache/palsar_frame)
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

constexpr int kLines = 18432;
constexpr int kSamples = 10000;

PalsarSimConfig frameConfig() {
  PalsarSimConfig cfg;
  cfg.mode = "FBS";
  cfg.layout = "JAXA";
  cfg.tones = {{3.0e6, 20.0}, {-7.5e6, 20.0}};
  cfg.bursts = {{7000, 25.0}, {12000, 25.0}};
  return cfg;
}

SceneDescription frameScene(const PalsarSimConfig& cfg) {
  SceneDescription s = support::palsarScene(cfg, kLines, kSamples);
  for (int i = 0; i < 6; ++i)
    s.pixelTargets.push_back({6000.0 + 1300.0 * i + 0.25, 800.0 + 1500.0 * i + 0.5, 20.0 * (i % 3), 4.0});
  s.seed = 24;
  return s;
}

// Simulates the frame unless the cache already holds it; the files of the
// product are listed in files.txt by role ("image", "leader").
bool ensureScene(const std::string& cache, PalsarSceneFiles& files, std::string& error) {
  const PalsarSimConfig cfg = frameConfig();
  const SceneDescription scene = frameScene(cfg);
  const std::string stamp = cache + "sim.done";
  const std::string key = "palsar fbs frame " + std::to_string(kLines) + "x" + std::to_string(kSamples) +
                          " seed " + std::to_string(scene.seed) + "\n";
  if (fs::exists(stamp) && support::readText(stamp) == key && fs::exists(cache + "files.txt")) {
    std::istringstream in(support::readText(cache + "files.txt"));
    std::string role, path;
    while (in >> role >> path) (role == "leader" ? files.leader : files.images.emplace_back()) = path;
    return !files.images.empty() && !files.leader.empty();
  }
  fs::remove_all(cache + "sim");
  fs::create_directories(cache);
  if (writePalsarScene(scene, cfg, cache + "sim", &files, error) != 0) return false;
  std::string list = "leader " + files.leader + "\n";
  for (const std::string& image : files.images) list += "image " + image + "\n";
  support::writeText(cache + "files.txt", list);
  support::writeText(stamp, key);
  return true;
}

// A copy of the resource folder whose PALSAR profile removes interference.
std::string resourcesWithInterferenceRemoval(const std::string& cache) {
  const std::string folder = cache + "resources/";
  fs::remove_all(folder);
  fs::copy(support::resourcesDir(), folder, fs::copy_options::recursive);
  std::string text = support::readText(folder + "parameters_PALSAR.hdr");
  const std::string key = "Remove_interferences = 0";
  if (const auto at = text.find(key); at != std::string::npos) text.replace(at, key.size(), "Remove_interferences = 1");
  support::writeText(folder + "parameters_PALSAR.hdr", text);
  return folder;
}

// The chain's stages with interference removal between extraction and
// range focusing, which then reads the filtered raster.
std::vector<frame_bench::Stage> palsarStages() {
  std::vector<frame_bench::Stage> stages = frame_bench::chainStages("Extraction completed");
  for (frame_bench::Stage& s : stages)
    if (s.name == "range_focusing") s.reads = {".interf"};
  stages.insert(stages.begin() + 2, {"interference", "Palsar preprocessing finished.", {".extracted"}});
  return stages;
}

void BM_PalsarFrame(benchmark::State& state) {
  const std::string cache = frame_bench::cacheDir("palsar_frame");
  PalsarSceneFiles files;
  std::string error;
  if (!ensureScene(cache, files, error)) {
    state.SkipWithError(("simulation failed: " + error).c_str());
    return;
  }
  const std::string resources = resourcesWithInterferenceRemoval(cache);
  const std::vector<frame_bench::Stage> stages = palsarStages();
  const double budget = frame_bench::profileMemoryMiB(resources + "parameters_PALSAR.hdr");
  frame_bench::reportFrame(state, stages, budget, "18432 x 10000 PALSAR FBS frame, interference removal, to SLC",
                           [&] {
                             const std::string run = cache + "run/";
                             fs::remove_all(run);
                             fs::create_directories(run);
                             support::Job job = support::palsarJob("PALSAR", files, run + "frame");
                             job[18] = "1";  // temporary rasters erased as the chain goes
                             support::writeJob(run + "job.txt", job);
                             return frame_bench::runFrame(run, run + "job.txt", stages, frame_bench::focuserPath(),
                                                          {{"TESSIVOR_CEOS_DES_FILES_DIR", resources}});
                           });
}
BENCHMARK(BM_PalsarFrame)->Unit(benchmark::kSecond)->UseManualTime()->Iterations(1);

}  // namespace

BENCHMARK_MAIN();
