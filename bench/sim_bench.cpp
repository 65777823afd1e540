// Speed of the raw-scene simulator: echo rendering of a block of an ERS
// frame (point targets alone, and with clutter and noise), and a whole ERS
// frame of 28,000 lines x 5,616 samples with 50 targets written to disk.
#include <benchmark/benchmark.h>

#include <filesystem>
#include <string>
#include <vector>

#include "sim/raw_scene.h"

namespace {

SceneDescription ersFrame(bool clutter) {
  SceneDescription s;
  s.mission = "ERS2";
  s.lines = 28000;
  s.samples = 5616;
  s.dopplerCentroidHz = 250.0;
  for (int i = 0; i < 50; ++i)
    s.pixelTargets.push_back({1500.0 + 500.0 * i + 0.3, 150.0 + 97.0 * i + 0.6, 10.0 * (i % 5), 4.0});
  if (clutter) {
    s.clutterSigma = 2.0;
    s.noiseSigma = 1.0;
  }
  return s;
}

void BM_RenderTargetLines(benchmark::State& state) {
  const RawSceneSimulator sim(ersFrame(false));
  std::vector<fcomplex> out;
  for (auto _ : state) {
    sim.renderLines(12000, 512, out);
    benchmark::DoNotOptimize(out.data());
  }
  state.SetItemsProcessed(state.iterations() * 512);
  state.SetLabel("lines of 5616 samples, targets only");
}
BENCHMARK(BM_RenderTargetLines)->Unit(benchmark::kMillisecond);

void BM_RenderClutterLines(benchmark::State& state) {
  const RawSceneSimulator sim(ersFrame(true));
  std::vector<fcomplex> out;
  for (auto _ : state) {
    sim.renderLines(12000, 512, out);
    benchmark::DoNotOptimize(out.data());
  }
  state.SetItemsProcessed(state.iterations() * 512);
  state.SetLabel("lines of 5616 samples, targets, clutter and noise");
}
BENCHMARK(BM_RenderClutterLines)->Unit(benchmark::kMillisecond);

// The whole frame with its leader, image file, orbit arc and truth.
void BM_WriteErsFrame(benchmark::State& state) {
  const RawSceneSimulator sim(ersFrame(true));
  const std::string dir = std::filesystem::temp_directory_path().string() + "/sim_bench_frame";
  for (auto _ : state) {
    std::string error;
    if (sim.writeErsScene(dir, error) != 0) state.SkipWithError(error.c_str());
  }
  std::filesystem::remove_all(dir);
  state.SetLabel("28000 x 5616, 50 targets, clutter and noise");
}
BENCHMARK(BM_WriteErsFrame)->Unit(benchmark::kSecond)->Iterations(1);

}  // namespace

BENCHMARK_MAIN();
