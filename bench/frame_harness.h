// Whole-scene timing harness shared by the frame benchmarks: runs the focuser
// on a job as the host runs it, cuts the run into stages at the checkpoints of
// Process.trace, and measures in the same run the floor of every stage:
//  - the transforms: the focuser writes a ledger of every transform it
//    executed (geometry, count, first and last execution time); each
//    geometry is planned the way the FFT layer plans it (FFTW_ESTIMATE, or
//    the wisdom of TESSIVOR_FFTW_WISDOM) and timed here;
//  - the rasters: every large file of the run folder is written and read
//    back once at its size, in the stage that wrote it and the stage that
//    reads it.
// A stage's floor wall time counts one-thread transforms spread over the
// cores; its floor CPU time is the CPU of the transforms and the I/O.
#pragma once

#include <benchmark/benchmark.h>
#include <fftw3.h>
#include <sys/resource.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <map>
#include <memory>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "support/files.h"
#include "support/host_run.h"

namespace frame_bench {

namespace fs = std::filesystem;

struct Stage {
  std::string name;
  std::string endMarker;              // checkpoint closing the stage; empty: process exit
  std::vector<std::string> reads{};   // raster name endings this stage reads whole
};

// The stages of a level-0 scene through the focusing chain; `extracted` is
// the checkpoint with which the sensor's extractor ends.
inline std::vector<Stage> chainStages(const std::string& extracted) {
  return {
      {"setup", "Starting ingestion"},
      {"extraction", extracted},
      {"preparation", "CHECKPOINT: Range Focusing"},
      {"range_focusing", "CHECKPOINT: DC Estimation", {".extracted"}},
      {"doppler", "CHECKPOINT: GEOMETRIC POLYNOMIALS COMPUTATION"},
      {"geometry", "CHECKPOINT: Azimuth Focusing"},
      {"azimuth_focusing", "CHECKPOINT: Writing headers", {".rgfoc"}},
      {"finishing", ""},
  };
}

struct StageTimes {
  double wall = 0.0, cpu = 0.0;
  double fftWall = 0.0, fftCpu = 0.0;  // floor of the transforms
  double ioWall = 0.0, ioCpu = 0.0;    // floor of the raster passes
  double floorWall() const { return fftWall + ioWall; }
  double floorCpu() const { return fftCpu + ioCpu; }
};

struct FrameRun {
  std::vector<StageTimes> stages;
  double totalWall = 0.0, totalCpu = 0.0, peakMiB = 0.0;
  std::string message;  // empty when the run succeeded
};

inline double seconds(std::chrono::steady_clock::time_point a, std::chrono::steady_clock::time_point b) {
  return std::chrono::duration<double>(b - a).count();
}

inline long long steadyNs(std::chrono::steady_clock::time_point t) {
  return std::chrono::duration_cast<std::chrono::nanoseconds>(t.time_since_epoch()).count();
}

// CPU seconds (user + system, all threads) of a running process.
inline double processCpu(pid_t pid) {
  const std::string stat = support::readText("/proc/" + std::to_string(pid) + "/stat");
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

// CPU seconds of this process.
inline double selfCpu() {
  timespec t{};
  clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &t);
  return static_cast<double>(t.tv_sec) + 1e-9 * static_cast<double>(t.tv_nsec);
}

inline int cores() {
  const unsigned n = std::thread::hardware_concurrency();
  return n == 0 ? 1 : static_cast<int>(n);
}

// One line of the transform ledger.
struct LedgerEntry {
  int kind = 0, n = 0, howmany = 0, istride = 0, idist = 0, ostride = 0, odist = 0, sign = 0;
  int threads = 1, inPlace = 0, aligned = 1;
  long long runs = 0, first = 0, last = 0;
};

inline std::vector<LedgerEntry> readLedger(const std::string& file) {
  std::vector<LedgerEntry> entries;
  std::ifstream in(file);
  std::string line;
  while (std::getline(in, line)) {
    if (line.empty() || line[0] == '#') continue;
    std::istringstream s(line);
    LedgerEntry e;
    if (s >> e.kind >> e.n >> e.howmany >> e.istride >> e.idist >> e.ostride >> e.odist >> e.sign >>
        e.threads >> e.inPlace >> e.aligned >> e.runs >> e.first >> e.last)
      entries.push_back(e);
  }
  return entries;
}

struct FftwFree {
  void operator()(void* p) const { fftwf_free(p); }
};

// Wall and CPU seconds of all the executions of one ledger line, planned as
// the FFT layer plans them. Long series are timed for about half a second
// and extrapolated.
inline bool timeTransform(const LedgerEntry& e, double& wall, double& cpu) {
  static const bool wisdom = [] {
    fftwf_init_threads();
    const char* path = std::getenv("TESSIVOR_FFTW_WISDOM");
    return path && *path && fftwf_import_wisdom_from_filename(path) != 0;
  }();
  auto extent = [](int n, int howmany, int stride, int dist) {
    return static_cast<std::size_t>(howmany - 1) * dist + static_cast<std::size_t>(n - 1) * stride + 1;
  };
  const std::size_t inFloats = extent(e.n, e.howmany, e.istride, e.idist) * (e.kind == 1 ? 1 : 2);
  const std::size_t outFloats = extent(e.kind == 0 ? e.n : e.n / 2 + 1, e.howmany, e.ostride, e.odist) *
                                (e.kind == 2 ? 1 : 2);
  const std::size_t pad = e.aligned ? 0 : 2;  // 8 bytes off FFTW's alignment
  const std::size_t inBytes = (std::max(inFloats, e.inPlace ? outFloats : 0) + pad + 2) * sizeof(float);
  std::unique_ptr<void, FftwFree> a(fftwf_malloc(inBytes));
  std::unique_ptr<void, FftwFree> b(e.inPlace ? nullptr : fftwf_malloc((outFloats + pad + 2) * sizeof(float)));
  if (!a || (!e.inPlace && !b)) return false;
  std::memset(a.get(), 0, inBytes);
  float* in = static_cast<float*>(a.get()) + pad;
  float* out = e.inPlace ? in : static_cast<float*>(b.get()) + pad;
  const int n[1] = {e.n};
  fftwf_plan_with_nthreads(e.threads);
  unsigned flags = (e.aligned ? 0u : FFTW_UNALIGNED) | (e.kind == 2 ? FFTW_DESTROY_INPUT : 0u);
  fftwf_plan p = nullptr;
  for (unsigned rigour : {wisdom ? unsigned(FFTW_MEASURE | FFTW_WISDOM_ONLY) : 0u, unsigned(FFTW_ESTIMATE)}) {
    if (rigour == 0u || p) continue;
    if (e.kind == 0)
      p = fftwf_plan_many_dft(1, n, e.howmany, reinterpret_cast<fftwf_complex*>(in), nullptr, e.istride, e.idist,
                              reinterpret_cast<fftwf_complex*>(out), nullptr, e.ostride, e.odist, e.sign,
                              flags | rigour);
    else if (e.kind == 1)
      p = fftwf_plan_many_dft_r2c(1, n, e.howmany, in, nullptr, e.istride, e.idist,
                                  reinterpret_cast<fftwf_complex*>(out), nullptr, e.ostride, e.odist, flags | rigour);
    else
      p = fftwf_plan_many_dft_c2r(1, n, e.howmany, reinterpret_cast<fftwf_complex*>(in), nullptr, e.istride,
                                  e.idist, out, nullptr, e.ostride, e.odist, flags | rigour);
  }
  if (!p) return false;
  const auto t0 = std::chrono::steady_clock::now();
  const double c0 = selfCpu();
  long long done = 0;
  while (done < e.runs) {
    fftwf_execute(p);
    ++done;
    if ((done & 7) == 0 && seconds(t0, std::chrono::steady_clock::now()) > 0.5) break;
  }
  const double scale = static_cast<double>(e.runs) / static_cast<double>(done);
  wall = seconds(t0, std::chrono::steady_clock::now()) * scale;
  cpu = (selfCpu() - c0) * scale;
  fftwf_destroy_plan(p);
  return true;
}

// Wall and CPU seconds to write `bytes` to a file and read them back.
inline void timeRasterPass(const std::string& file, std::uintmax_t bytes, double& writeWall, double& writeCpu,
                           double& readWall, double& readCpu) {
  constexpr std::size_t kChunk = std::size_t(4) << 20;
  std::vector<char> chunk(kChunk, 1);
  auto t0 = std::chrono::steady_clock::now();
  double c0 = selfCpu();
  if (std::FILE* f = std::fopen(file.c_str(), "wb")) {
    for (std::uintmax_t left = bytes; left > 0;) {
      const std::size_t n = static_cast<std::size_t>(std::min<std::uintmax_t>(left, kChunk));
      if (std::fwrite(chunk.data(), 1, n, f) != n) break;
      left -= n;
    }
    std::fclose(f);
  }
  writeWall = seconds(t0, std::chrono::steady_clock::now());
  writeCpu = selfCpu() - c0;
  t0 = std::chrono::steady_clock::now();
  c0 = selfCpu();
  if (std::FILE* f = std::fopen(file.c_str(), "rb")) {
    while (std::fread(chunk.data(), 1, kChunk, f) == kChunk) {
    }
    std::fclose(f);
  }
  readWall = seconds(t0, std::chrono::steady_clock::now());
  readCpu = selfCpu() - c0;
  fs::remove(file);
}

// A stage may write its output over the file it reads and rename it (a job
// that erases its temporaries does), so a raster is known by its name: its
// size is the last one seen, its writer the stage in which the name first
// held data.
struct Raster {
  std::uintmax_t bytes = 0;
  int writer = -1;
};

// Runs the focuser once on `jobFile` in `folder` and measures its floor.
inline FrameRun runFrame(const std::string& folder, const std::string& jobFile, const std::vector<Stage>& stages,
                         const std::string& executable,
                         const std::map<std::string, std::string>& variables = {}) {
  FrameRun t;
  t.stages.resize(stages.size());
  const std::string ledger = folder + "fft_ledger.txt";
  std::vector<long long> stageEnd(stages.size(), 0);  // steady clock, ns
  std::map<std::string, Raster> rasters;
  std::size_t next = 0;  // next stage whose end is awaited
  double lastWall = 0.0, lastCpu = 0.0;
  const auto started = std::chrono::steady_clock::now();
  support::RunOptions options;
  options.executable = executable;
  options.pollMilliseconds = 5;
  options.timeoutSeconds = 7200;
  options.variables = variables;
  options.variables["TESSIVOR_FFT_LEDGER"] = ledger;
  auto scanRasters = [&] {
    std::error_code ec;
    for (const auto& entry : fs::directory_iterator(folder, ec)) {
      std::error_code sizeError;
      const std::uintmax_t size = entry.is_regular_file(sizeError) ? entry.file_size(sizeError) : 0;
      if (sizeError || size < (std::uintmax_t(1) << 20)) continue;
      Raster& r = rasters[entry.path().filename().string()];
      r.bytes = size;
      if (r.writer < 0) r.writer = static_cast<int>(next);
    }
  };
  options.hook = [&](const support::RunningFocuser& running) {
    // The stage first: a raster that appears with a checkpoint belongs to
    // the stage the checkpoint opens.
    if (next + 1 >= stages.size()) {
      scanRasters();
      return;
    }
    const double cpu = processCpu(running.pid);
    const std::string text = support::readText(running.folder + "Process.trace");
    while (next + 1 < stages.size() && text.find(stages[next].endMarker) != std::string::npos) {
      const auto now = std::chrono::steady_clock::now();
      const double wall = seconds(started, now);
      t.stages[next].wall = wall - lastWall;
      t.stages[next].cpu = cpu >= 0.0 ? cpu - lastCpu : 0.0;
      stageEnd[next] = steadyNs(now);
      lastWall = wall;
      if (cpu >= 0.0) lastCpu = cpu;
      ++next;
    }
    scanRasters();
  };
  const support::FocuserRun r = support::runFocuser(folder, jobFile, options);
  scanRasters();  // final sizes of what the run keeps
  t.totalWall = r.seconds;
  t.totalCpu = r.cpuSeconds;
  t.peakMiB = r.peakMiB;
  t.stages.back().wall = t.totalWall - lastWall;
  t.stages.back().cpu = t.totalCpu - lastCpu;
  stageEnd.back() = steadyNs(std::chrono::steady_clock::now());
  if (r.exitStatus != 0 || r.errorCode != 0) {
    t.message = "focuser failed (status " + std::to_string(r.exitStatus) + "), see " + folder + "Process.log";
    return t;
  }
  if (next + 1 < stages.size()) {
    t.message = "checkpoint not found in the trace: " + stages[next].endMarker;
    return t;
  }

  // Transforms, each geometry in the stage that holds the middle of its use.
  const int nCores = cores();
  for (const LedgerEntry& e : readLedger(ledger)) {
    const long long mid = e.first / 2 + e.last / 2;
    std::size_t s = 0;
    while (s + 1 < stages.size() && mid > stageEnd[s]) ++s;
    double wall = 0.0, cpu = 0.0;
    if (!timeTransform(e, wall, cpu)) continue;
    t.stages[s].fftCpu += cpu;
    t.stages[s].fftWall += e.threads > 1 ? wall : wall / nCores;
  }
  fs::remove(ledger);

  // Raster passes: written in the stage that wrote them, read in a stage
  // that names them. A file of the size of an earlier one that is gone is
  // that raster renamed, not written again.
  auto renamed = [&](const std::string& name, const Raster& raster) {
    for (const auto& [other, r] : rasters)
      if (other != name && r.bytes == raster.bytes && r.writer <= raster.writer && !fs::exists(folder + other))
        return true;
    return false;
  };
  for (const auto& [name, raster] : rasters) {
    const bool written = raster.writer >= 0 && !renamed(name, raster);
    std::vector<std::size_t> readers;
    for (std::size_t s = 0; s < stages.size(); ++s)
      for (const std::string& ending : stages[s].reads)
        if (name.size() >= ending.size() && name.compare(name.size() - ending.size(), ending.size(), ending) == 0)
          readers.push_back(s);
    if (!written && readers.empty()) continue;
    double ww = 0.0, wc = 0.0, rw = 0.0, rc = 0.0;
    timeRasterPass(folder + "floor.scratch", raster.bytes, ww, wc, rw, rc);
    if (written) {
      t.stages[raster.writer].ioWall += ww;
      t.stages[raster.writer].ioCpu += wc;
    }
    for (std::size_t s : readers) {
      t.stages[s].ioWall += rw;
      t.stages[s].ioCpu += rc;
    }
  }
  return t;
}

// Runs `run` once per benchmark iteration and reports the mean stage times
// beside their floors, the ratio of the whole job to its floor, and the peak
// memory against the profile's budget.
template <class RunOnce>
void reportFrame(benchmark::State& state, const std::vector<Stage>& stages, double memoryBudgetMiB,
                 const std::string& label, RunOnce run) {
  FrameRun sum;
  sum.stages.resize(stages.size());
  int runs = 0;
  for (auto _ : state) {
    const FrameRun t = run();
    if (!t.message.empty()) {
      state.SkipWithError(t.message.c_str());
      return;
    }
    for (std::size_t i = 0; i < stages.size(); ++i) {
      StageTimes& a = sum.stages[i];
      const StageTimes& b = t.stages[i];
      a.wall += b.wall;
      a.cpu += b.cpu;
      a.fftWall += b.fftWall;
      a.fftCpu += b.fftCpu;
      a.ioWall += b.ioWall;
      a.ioCpu += b.ioCpu;
    }
    sum.totalWall += t.totalWall;
    sum.totalCpu += t.totalCpu;
    sum.peakMiB = std::max(sum.peakMiB, t.peakMiB);
    ++runs;
    state.SetIterationTime(t.totalWall);
  }
  if (runs == 0) return;
  std::fprintf(stderr, "\n%-18s %8s %8s   %8s %8s   %7s %7s\n", "stage", "wall s", "cpu s", "floor w", "floor c",
               "fft c", "io w");
  double floorWall = 0.0, floorCpu = 0.0;
  for (std::size_t i = 0; i < stages.size(); ++i) {
    const StageTimes& s = sum.stages[i];
    const double w = s.wall / runs, c = s.cpu / runs, fw = s.floorWall() / runs, fc = s.floorCpu() / runs;
    floorWall += fw;
    floorCpu += fc;
    std::fprintf(stderr, "%-18s %8.2f %8.2f   %8.2f %8.2f   %7.2f %7.2f\n", stages[i].name.c_str(), w, c, fw, fc,
                 s.fftCpu / runs, s.ioWall / runs);
    state.counters[stages[i].name + "_wall"] = w;
    state.counters[stages[i].name + "_cpu"] = c;
    state.counters[stages[i].name + "_floor_wall"] = fw;
  }
  const double wall = sum.totalWall / runs, cpu = sum.totalCpu / runs;
  std::fprintf(stderr, "%-18s %8.2f %8.2f   %8.2f %8.2f\n", "total", wall, cpu, floorWall, floorCpu);
  std::fprintf(stderr, "ratio to the floor: wall %.2f, cpu %.2f; peak %.0f MiB (Memory budget %.0f MiB)\n\n",
               floorWall > 0.0 ? wall / floorWall : 0.0, floorCpu > 0.0 ? cpu / floorCpu : 0.0, sum.peakMiB,
               memoryBudgetMiB);
  state.counters["total_wall"] = wall;
  state.counters["total_cpu"] = cpu;
  state.counters["floor_wall"] = floorWall;
  state.counters["floor_cpu"] = floorCpu;
  state.counters["peak_MiB"] = sum.peakMiB;
  state.counters["memory_budget_MiB"] = memoryBudgetMiB;
  state.SetLabel(label);
}

// `Memory` of the [sarfocuserConfiguration] section of a profile, MiB; 0 when absent.
inline double profileMemoryMiB(const std::string& profile) {
  std::ifstream in(profile);
  std::string line;
  bool inSection = false;
  while (std::getline(in, line)) {
    if (!line.empty() && line[0] == '[') inSection = line.rfind("[sarfocuserConfiguration]", 0) == 0;
    if (!inSection) continue;
    std::istringstream s(line);
    std::string key, eq;
    double value = 0.0;
    if (s >> key >> eq >> value && key == "Memory" && eq == "=") return value;
  }
  return 0.0;
}

inline fs::path executableDir() { return fs::read_symlink("/proc/self/exe").parent_path(); }

// Cache folder of a benchmark's simulated scene: the variable, else
// <build>/bench-cache/<name>.
inline std::string cacheDir(const std::string& name) {
  if (const char* c = std::getenv("TESSIVOR_BENCH_CACHE")) return std::string(c) + "/";
  return (executableDir().parent_path() / "bench-cache" / name).string() + "/";
}

inline std::string focuserPath() {
  if (const char* f = std::getenv("TESSIVOR_BENCH_FOCUSER")) return f;
  return (executableDir() / "stripmap_focuser").string();
}

}  // namespace frame_bench
