// Azimuth focusing of an ERS-sized range-compressed raster (8192 lines of
// 5616 samples) from disk to disk with the ERS block sizes (8192-line blocks,
// full azimuth overlap 2560, 1024-sample range sub-blocks with overlap 64),
// with the kernel without interpolation (0) and the least-squares Stolt
// kernel (7), on 1 and 2 threads. Counters: input and output lines per
// second, input lines per CPU second of the process (all threads, user and
// system: the cost on a shared machine), the share of the time FFTW alone
// needs for the block transforms, and the speed-up over one thread. The
// raster is written once into TESSIVOR_BENCH_DIR (or the temporary folder)
// and removed at exit.
#include <benchmark/benchmark.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <random>
#include <string>
#include <utility>
#include <vector>

#include <sys/resource.h>
#include <unistd.h>

#ifdef _OPENMP
#include <omp.h>
#endif

#include "core/azimuth_block.h"
#include "core/azimuth_focus.h"
#include "core/fft.h"

namespace {

constexpr int kLines = 8192;
constexpr int kSamples = 5616;
constexpr double kFrg = 18.96e6;
constexpr double kPrf = 1679.9;
constexpr double kFc = 5.3e9;
constexpr double kNear = 830e3;
constexpr double kC = 299792458.0;

struct Scene {
  std::filesystem::path dir;
  AzimuthFocusFiles files;
  AzimuthFocusScene scene;
  AzimuthFocusConf conf;
  Scene() {
    const char* base = std::getenv("TESSIVOR_BENCH_DIR");
    dir = std::filesystem::path(base ? base : std::filesystem::temp_directory_path().string()) /
          ("azimuth_bench_" + std::to_string(::getpid()));
    std::filesystem::create_directories(dir);
    files.input = (dir / "in.rgfoc").string();
    files.output = (dir / "out").string();
    files.frg_hz = kFrg;
    files.fc_hz = kFc;
    files.prf_hz = kPrf;
    files.FastStartTime = 2.0 * kNear / kC;
    files.bandwidth_hz = 15.55e6;
    scene.samples = kSamples;
    scene.lines = kLines;
    // ERS-like models: centroid 300 Hz, rate -2 V^2 / (lambda R).
    const double tref = files.FastStartTime + 0.5 * kSamples / kFrg;
    const double lambda = kC / kFc, V = 7100.0;
    const double a = -4.0 * V * V / (lambda * kC);  // rate = a / tau
    scene.polyDC[0] = 300.0;
    scene.polyDC[7] = tref;
    scene.polyFR[0] = a / tref;
    scene.polyFR[1] = -a / (tref * tref);
    scene.polyFR[4] = a / (tref * tref * tref);
    scene.polyFR[7] = tref;
    conf.AntennaLength = 9.45;
    conf.WhiteningFlag = 1;
    conf.RangeWindowHammingParameter = 0.75;
    conf.AzimuthWindowHammingParameter = 0.75;
    conf.RangeLookBandwidth = conf.RangeTransitionBandwidth = 0.8 * kFrg;
    conf.AzimuthLookBandwidth = conf.AzimuthTransitionBandwidth = 0.8 * kPrf;
    conf.LinesInBlock = 8192;
    conf.SamplesInBlock = 1024;
    conf.RangeOverlap = 32;
    conf.AzimuthOverlap = 1280;
    conf.StoltPadding = 0.4;
    // Range-compressed speckle: complex Gaussian samples.
    std::ofstream f(files.input, std::ios::binary);
    std::mt19937 gen(7);
    std::normal_distribution<float> n(0.0f, 1.0f);
    std::vector<fcomplex> line(kSamples);
    for (int l = 0; l < kLines; ++l) {
      for (auto& x : line) x = fcomplex(n(gen), n(gen));
      f.write(reinterpret_cast<const char*>(line.data()), sizeof(fcomplex) * kSamples);
    }
  }
  ~Scene() { std::filesystem::remove_all(dir); }
};

// CPU seconds of the whole process (every thread), user plus system.
double processCpuSeconds() {
  rusage u{};
  getrusage(RUSAGE_SELF, &u);
  return u.ru_utime.tv_sec + u.ru_utime.tv_usec * 1e-6 + u.ru_stime.tv_sec +
         u.ru_stime.tv_usec * 1e-6;
}

Scene& scene() {
  static Scene s;
  return s;
}

void setThreads(int n) {
  fft_set_threads(n);
#ifdef _OPENMP
  omp_set_num_threads(n);
#endif
}

// The transforms of the block kernel alone: per range sub-block forward row
// and column transforms, then inverse row and column transforms of 8192 x
// 1024 samples (columns by strips, as the kernels do them).
double fftOnlySeconds(int subBlocks) {
  const int L = 8192, S = 1024;
  FFTBuffer buf(static_cast<std::size_t>(L) * S, fcomplex(1.0f, 0.5f));
  FFTPlan fwd, rowInv;
  fft_makep_c(fwd, S, S, L, L, FFT_FORWARD, FFT_NONE, 1);
  fft_makep_c(rowInv, S, S, L, L, FFT_BACKWARD_NORMALISED, FFT_NONE, 1);
  const auto t0 = std::chrono::steady_clock::now();
  for (int b = 0; b < subBlocks; ++b) {
    pfft_c(fwd, buf.data(), buf.data());
    wk_column_transform(buf.data(), S, S, L, FFT_FORWARD);
    pfft_c(rowInv, buf.data(), buf.data());
    wk_column_transform(buf.data(), S, S, L, FFT_BACKWARD_NORMALISED);
  }
  const double s = std::chrono::duration<double>(std::chrono::steady_clock::now() - t0).count();
  fft_destp_c(fwd);
  fft_destp_c(rowInv);
  return s;
}

std::map<int, double>& oneThreadSeconds() {
  static std::map<int, double> m;
  return m;
}

void BM_AzimuthFocusFromDisk(benchmark::State& state) {
  Scene& s = scene();
  const int threads = static_cast<int>(state.range(0));
  const int interp = static_cast<int>(state.range(1));
  setThreads(threads);
  AzimuthFocusConf conf = s.conf;
  conf.PerformInterpolation = interp;
  double seconds = 0.0, cpu = 0.0;
  AzimuthFocusScene sc = s.scene;
  for (auto _ : state) {
    sc = s.scene;
    const double c0 = processCpuSeconds();
    const auto t0 = std::chrono::steady_clock::now();
    const int st = azimuthfoc(s.files, sc, conf);
    seconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - t0).count();
    cpu = processCpuSeconds() - c0;
    if (st != 0) state.SkipWithError("azimuthfoc failed");
  }
  const int subBlocks = (kSamples - 64 + (1024 - 64) - 1) / (1024 - 64);
  const double fft = fftOnlySeconds(subBlocks);
  state.counters["in_lines_per_s"] = kLines / seconds;
  state.counters["in_lines_per_cpu_s"] = kLines / cpu;
  state.counters["out_lines_per_s"] = sc.outLines / seconds;
  state.counters["fft_share"] = fft / seconds;
  if (threads == 1) oneThreadSeconds()[interp] = seconds;
  if (oneThreadSeconds().count(interp))
    state.counters["speedup_vs_1"] = oneThreadSeconds()[interp] / seconds;
  setThreads(0);
}

BENCHMARK(BM_AzimuthFocusFromDisk)
    ->ArgNames({"threads", "interp"})
    ->Args({1, 0})
    ->Args({2, 0})
    ->Args({1, 7})
    ->Args({2, 7})
    ->Iterations(1)
    ->Unit(benchmark::kSecond);

}  // namespace

BENCHMARK_MAIN();
