// Range compression of an ERS-sized raw raster (8192 lines of 5616 samples
// with SWST prefixes) from disk to disk, against the time FFTW alone needs
// for the forward and backward transforms of the same lines. Run with 1 and
// 2 FFT threads. The raster is written once into TESSIVOR_BENCH_DIR (or the
// temporary folder) and removed at exit.
#include <benchmark/benchmark.h>

#include <chrono>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <random>
#include <string>
#include <numbers>
#include <vector>

#include <unistd.h>

#include "core/fft.h"
#include "core/range_focus.h"

namespace {

constexpr int kLines = 8192;
constexpr int kSamples = 5616;
constexpr double kFs = 18.96e6;
constexpr double kSwstMin = 5.5e-3;
constexpr int kMaxShift = 40;
constexpr int kLinesPerBlock = 2048;

struct Scene {
  std::filesystem::path dir;
  std::string raw, out;
  std::vector<fcomplex> replica;
  Scene() {
    const char* base = std::getenv("TESSIVOR_BENCH_DIR");
    dir = std::filesystem::path(base ? base : std::filesystem::temp_directory_path().string()) /
          ("range_focus_bench_" + std::to_string(::getpid()));
    std::filesystem::create_directories(dir);
    raw = (dir / "raw").string();
    out = (dir / "rgfoc").string();
    // ERS replica: 37.12 us, 15.55 MHz.
    const double T = 37.12e-6, k = 15.55e6 / T;
    const int n = static_cast<int>(std::lround(kFs * T));
    replica.resize(n);
    for (int m = 0; m < n; ++m) {
      const double t = (m - (n - 1) / 2.0) / kFs;
      replica[m] = fcomplex(std::polar(1.0, std::numbers::pi * k * t * t));
    }
    std::ofstream f(raw, std::ios::binary);
    std::mt19937 gen(1);
    std::uniform_int_distribution<int> level(0, 31);
    std::vector<fcomplex> line(kSamples);
    for (int l = 0; l < kLines; ++l) {
      const float swst = static_cast<float>(kSwstMin + ((l / 1000) % 3) * 10 / kFs);
      for (auto& x : line) x = fcomplex(level(gen) - 15.5f, level(gen) - 15.5f);
      f.write(reinterpret_cast<const char*>(&swst), sizeof swst);
      f.write(reinterpret_cast<const char*>(line.data()), sizeof(fcomplex) * kSamples);
    }
  }
  ~Scene() { std::filesystem::remove_all(dir); }
};

Scene& scene() {
  static Scene s;
  return s;
}

// Forward and backward transforms of kLines lines of length N in the
// correlator's chunks, nothing else. The lines stream through a buffer
// larger than the caches, as in the correlator.
double fftOnlySeconds(int N, int chunk) {
  const int bufferLines = 1024 / chunk * chunk;
  FFTBuffer buf(static_cast<std::size_t>(N) * bufferLines, fcomplex(1.0f, 0.5f));
  FFTPlan fwd, bwd;
  fft_makep_c(fwd, N, N, chunk, chunk, FFT_FORWARD, FFT_NONE, 1);
  fft_makep_c(bwd, N, N, chunk, chunk, FFT_BACKWARD, FFT_NONE, 1);
  double best = 1e30;
  for (int rep = 0; rep < 3; ++rep) {
    const auto t0 = std::chrono::steady_clock::now();
    for (int l = 0; l < kLines; l += chunk) {
      fcomplex* rows = buf.data() + static_cast<std::size_t>(l % bufferLines) * N;
      pfft_c(fwd, rows, rows);
      pfft_c(bwd, rows, rows);
    }
    best = std::min(best, std::chrono::duration<double>(std::chrono::steady_clock::now() - t0).count());
  }
  return best;
}

void BM_RangeFocusFromDisk(benchmark::State& state) {
  fft_set_threads(static_cast<int>(state.range(0)));
  Scene& s = scene();
  RangeFocParams p;
  p.inputFile = s.raw;
  p.outputFile = s.out;
  p.fs = kFs;
  p.swstMin = kSwstMin;
  p.swstMax = kSwstMin + kMaxShift / kFs;
  p.lines = kLines;
  p.samples = kSamples;
  double seconds = 0.0;
  int runs = 0;
  int N = 0, chunk = 0;
  for (auto _ : state) {
    RangeFocWork w;
    w.replica = s.replica.data();
    w.replicaLen = static_cast<int>(s.replica.size());
    w.linesPerBlock = kLinesPerBlock;
    const auto t0 = std::chrono::steady_clock::now();
    if (rangefoc(p, w) != 0) state.SkipWithError("rangefoc failed");
    seconds += std::chrono::duration<double>(std::chrono::steady_clock::now() - t0).count();
    ++runs;
  }
  {
    RangeCompressor rc;
    rc.init(s.replica.data(), static_cast<int>(s.replica.size()),
            genpow(kSamples + kMaxShift, 1));
    N = rc.fftLength();
    chunk = rc.chunkRows();
  }
  const double fft = fftOnlySeconds(N, chunk);
  state.counters["lines_per_s"] =
      benchmark::Counter(static_cast<double>(kLines) * runs / seconds);
  state.counters["fftw_s"] = fft;
  state.counters["ratio_to_fftw"] = seconds / runs / fft;
  state.counters["threads"] = fft_get_threads();
  fft_set_threads(0);
}

void BM_RangeCompressInMemory(benchmark::State& state) {
  fft_set_threads(static_cast<int>(state.range(0)));
  Scene& s = scene();
  RangeCompressor rc;
  rc.init(s.replica.data(), static_cast<int>(s.replica.size()), genpow(kSamples + kMaxShift, 1));
  const int rows = 1024;
  FFTBuffer buf(static_cast<std::size_t>(rc.fftLength()) * rows, fcomplex(0.25f, -0.5f));
  for (auto _ : state) {
    rc.compress(buf.data(), rows);
    benchmark::ClobberMemory();
  }
  state.counters["lines_per_s"] =
      benchmark::Counter(static_cast<double>(rows), benchmark::Counter::kIsIterationInvariantRate);
  fft_set_threads(0);
}

}  // namespace

BENCHMARK(BM_RangeFocusFromDisk)->Arg(1)->Arg(2)->Unit(benchmark::kMillisecond)->Iterations(2)->UseRealTime();
BENCHMARK(BM_RangeCompressInMemory)->Arg(1)->Arg(2)->Unit(benchmark::kMillisecond)->UseRealTime();

BENCHMARK_MAIN();
