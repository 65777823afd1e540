// Speed of ASAR level-0 extraction: the FBAQ decoder alone on image-mode
// lines of 5,600 samples, and the whole extraction (packet walk, decoding,
// droop correction, raster writing) of a full image-mode frame of 28,000
// lines simulated once into a cache folder. Rates are lines per second.
//   TESSIVOR_BENCH_CACHE   cache folder (default <build>/bench-cache/asar_frame)
#include <benchmark/benchmark.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <random>
#include <sstream>
#include <string>
#include <vector>

#include "ingest/envisat/asar_aux.h"
#include "ingest/envisat/enviextractor.h"
#include "sim/envisat_aux_writer.h"
#include "sim/envisat_level0_writer.h"

namespace {

namespace fs = std::filesystem;

constexpr int kLines = 28000;
constexpr int kSamples = 5600;

fs::path cacheDir() {
  if (const char* c = std::getenv("TESSIVOR_BENCH_CACHE")) return c;
  return fs::read_symlink("/proc/self/exe").parent_path().parent_path() / "bench-cache" / "asar_frame";
}

std::string readText(const fs::path& file) {
  std::ifstream in(file);
  std::stringstream s;
  s << in.rdbuf();
  return s.str();
}

// The frame's files, simulated unless the cache already holds them.
bool ensureFrame(AsarSceneFiles& files, std::string& error) {
  const fs::path cache = cacheDir();
  const fs::path stamp = cache / "sim.done";
  const std::string key = "asar im frame " + std::to_string(kLines) + "x" + std::to_string(kSamples) + "\n";
  AsarSimConfig cfg;
  SceneDescription s;
  simParseDate("28-MAR-2010 09:58:12.000", s.startTime);
  s.orbit.epoch = s.startTime;
  s.lines = kLines;
  s.samples = kSamples;
  s.nearRangeTime = 0.00555;
  s.dopplerCentroidHz = 250.0;
  s.clutterSigma = 2.0;
  s.noiseSigma = 1.0;
  s.seed = 23;
  applyAsarInstrument(cfg, s);
  try {
    const RawSceneSimulator sim(s);
    if (fs::exists(stamp) && readText(stamp) == key) {
      // Names only: the files are there.
      files.auxDir = (cache / "sim" / "aux").string();
      for (const auto& e : fs::directory_iterator(files.auxDir)) {
        const std::string n = e.path().filename().string();
        if (n.rfind("ASA_INS", 0) == 0) files.ins = e.path().string();
        if (n.rfind("ASA_XCA", 0) == 0) files.xca = e.path().string();
      }
      for (const auto& e : fs::directory_iterator(cache / "sim"))
        if (e.path().filename().string().rfind("ASA_IM", 0) == 0) files.level0 = e.path().string();
      return true;
    }
    fs::remove_all(cache / "sim");
    fs::create_directories(cache);
    if (writeEnvisatScene(sim, cfg, (cache / "sim").string(), &files, error) != 0) return false;
  } catch (const std::exception& e) {
    error = e.what();
    return false;
  }
  std::ofstream(stamp) << key;
  return true;
}

void BM_FbaqDecodeImageModeLine(benchmark::State& state) {
  std::vector<fcomplex> echo(kSamples);
  std::mt19937 rng(5);
  std::normal_distribution<float> n(0.0f, 20.0f);
  for (auto& v : echo) v = fcomplex(n(rng), n(rng));
  std::vector<unsigned char> line(std::size_t(FbaqCodec::lineBytes(kSamples)));
  FbaqCodec::encodeLine(echo.data(), kSamples, line.data());
  for (int l = 0; l < 16; ++l)
    for (int b = 0; b < 256; ++b) fbaq_tables().I[std::size_t(256 * l + b)] = fbaq_tables().Q[std::size_t(256 * l + b)] = FbaqCodec::level(l, b);
  std::vector<float> out(2 * std::size_t(kSamples));
  int floats = 0, lines = 0;
  for (auto _ : state) {
    fbaq_decode84_f(line.data(), out.data(), int(line.size()), kSamples, 1, &floats, &lines);
    benchmark::DoNotOptimize(out.data());
  }
  state.counters["lines_per_s"] = benchmark::Counter(double(state.iterations()), benchmark::Counter::kIsRate);
}
BENCHMARK(BM_FbaqDecodeImageModeLine);

void BM_ExtractImageModeFrame(benchmark::State& state) {
  AsarSceneFiles files;
  std::string error;
  if (!ensureFrame(files, error)) {
    state.SkipWithError(error.c_str());
    return;
  }
  const fs::path out = cacheDir() / "run";
  fs::create_directories(out);
  int lines = 0;
  for (auto _ : state) {
    enviextractor x;
    x.input.ASA_Level0_File = files.level0;
    x.input.ASA_INS_File = files.ins;
    x.input.ASA_XCA_File = files.xca;
    x.output.OutputRawFile = (out / "frame.extracted").string();
    if (x.run() != 0) {
      state.SkipWithError("extraction failed");
      break;
    }
    lines = x.getVectorLength();
  }
  fs::remove_all(out);
  state.counters["lines"] = lines;
  state.counters["lines_per_s"] =
      benchmark::Counter(double(lines) * double(state.iterations()), benchmark::Counter::kIsRate);
}
BENCHMARK(BM_ExtractImageModeFrame)->Unit(benchmark::kSecond)->Iterations(1)->UseRealTime();

}  // namespace

BENCHMARK_MAIN();
