// Block I/O of a FLOAT_COMPLEX raster (2 GiB by default) by blocks of lines
// through DataFile+BufferIO and BufferFile, against plain fread/fwrite of the
// same bytes. Environment: TESSIVOR_BENCH_DIR (folder of the scratch file,
// default a scratch folder removed at exit), TESSIVOR_BENCH_RASTER_MB (file size, default 2048).
#include <benchmark/benchmark.h>

#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <string>
#include <vector>

#include "base/fcomplex.h"
#include "product/buffer_file.h"
#include "product/buffer_io.h"
#include "product/data_file.h"
#include "support/files.h"

namespace {

constexpr int kPixels = 8192;       // 64 KiB rows
constexpr int kBlockLines = 256;    // 16 MiB blocks

int64_t megabytes() {
  const char* v = std::getenv("TESSIVOR_BENCH_RASTER_MB");
  const long mb = v ? std::atol(v) : 2048;
  return mb > 0 ? mb : 2048;
}
int lines() { return int(megabytes() * (1 << 20) / (int64_t(kPixels) * 8)); }
int64_t totalBytes() { return int64_t(lines()) * kPixels * 8; }

// In TESSIVOR_BENCH_DIR when set, else in a scratch folder removed at exit.
std::string scratchName() {
  const char* d = std::getenv("TESSIVOR_BENCH_DIR");
  return (d ? std::string(d) + "/" : support::scratchDir("bench_raster")) + "tessivor_bench_raster_" +
         std::to_string(::getpid()) + ".slc";
}
const std::string& scratch() {
  static const std::string name = scratchName();
  return name;
}

std::vector<fcomplex>& block() {
  static std::vector<fcomplex> b = [] {
    std::vector<fcomplex> v(size_t(kPixels) * kBlockLines);
    for (size_t i = 0; i < v.size(); ++i) v[i] = fcomplex(float(i % 1000), -float(i % 333));
    return v;
  }();
  return b;
}

void describe(DataFile& f) {
  f.filename = scratch();
  f.CellType = FLOAT_COMPLEX;
  f.NrOfPixelsPerLine = kPixels;
  f.NrOfLinesPerImage = lines();
}

void describe(BufferFile& f) {
  f.setFilename(scratch());
  f.setType(BufferFile::FLOAT_COMPLEX);
  f.setSamples(kPixels);
  f.setLines(lines());
}

void rate(benchmark::State& state) {
  const double bytes = double(totalBytes()) * double(state.iterations());
  state.SetBytesProcessed(int64_t(bytes));
  state.counters["MB/s"] = benchmark::Counter(bytes / 1e6, benchmark::Counter::kIsRate);
}

void plainWrite() {
  std::FILE* f = std::fopen(scratch().c_str(), "wb");
  if (!f) return;
  const size_t n = block().size() * sizeof(fcomplex);
  for (int l = 0; l < lines(); l += kBlockLines) std::fwrite(block().data(), 1, n, f);
  std::fclose(f);
}

void ensureFile() {
  std::error_code ec;
  if (std::filesystem::file_size(scratch(), ec) != uintmax_t(totalBytes())) plainWrite();
}

void BM_PlainFwrite(benchmark::State& state) {
  for (auto _ : state) plainWrite();
  rate(state);
}

void BM_BufferIOWrite(benchmark::State& state) {
  for (auto _ : state) {
    DataFile f;
    describe(f);
    if (f.open(1) != 0) state.SkipWithError("cannot open the scratch file");
    for (int l = 0; l < lines(); l += kBlockLines) {
      BufferIO io{&f, 0, kPixels, l, kBlockLines, FLOAT_COMPLEX};
      benchmark::DoNotOptimize(io.writebuffer(block().data()));
    }
    f.close();
  }
  rate(state);
}

void BM_BufferFileWrite(benchmark::State& state) {
  for (auto _ : state) {
    BufferFile f;
    describe(f);
    if (!f.open(BufferFile::WRITE)) state.SkipWithError("cannot open the scratch file");
    for (int l = 0; l < lines(); l += kBlockLines)
      benchmark::DoNotOptimize(f.writebuffer(block().data(), l, kBlockLines, 0, 0));
    f.close();
  }
  rate(state);
}

void BM_PlainFread(benchmark::State& state) {
  ensureFile();
  std::vector<fcomplex> buf(block().size());
  for (auto _ : state) {
    std::FILE* f = std::fopen(scratch().c_str(), "rb");
    if (!f) state.SkipWithError("cannot open the scratch file");
    for (int l = 0; l < lines() && f; l += kBlockLines)
      benchmark::DoNotOptimize(std::fread(buf.data(), sizeof(fcomplex), buf.size(), f));
    if (f) std::fclose(f);
  }
  rate(state);
}

void BM_BufferIORead(benchmark::State& state) {
  ensureFile();
  std::vector<fcomplex> buf(block().size());
  for (auto _ : state) {
    DataFile f;
    describe(f);
    for (int l = 0; l < lines(); l += kBlockLines) {
      BufferIO io{&f, 0, kPixels, l, kBlockLines, FLOAT_COMPLEX};
      benchmark::DoNotOptimize(io.readbuffer(buf.data()));
    }
    f.close();
  }
  rate(state);
}

void BM_BufferFileRead(benchmark::State& state) {
  ensureFile();
  std::vector<fcomplex> buf(block().size());
  for (auto _ : state) {
    BufferFile f;
    describe(f);
    if (!f.open(BufferFile::READ)) state.SkipWithError("cannot open the scratch file");
    for (int l = 0; l < lines(); l += kBlockLines)
      benchmark::DoNotOptimize(f.readbuffer(buf.data(), l, kBlockLines, 0, 0));
    f.close();
  }
  rate(state);
}

// Through a 32 MiB read window, as the multi-looker reads its input.
void BM_BufferFileWindowRead(benchmark::State& state) {
  ensureFile();
  std::vector<fcomplex> buf(block().size());
  for (auto _ : state) {
    BufferFile f;
    describe(f);
    if (!f.open(BufferFile::READ)) state.SkipWithError("cannot open the scratch file");
    f.initbuffer(33554432, 2097152);
    for (int l = 0; l < lines(); l += kBlockLines)
      benchmark::DoNotOptimize(f.readbuffer(buf.data(), l, kBlockLines, 0, 0));
    f.close();
  }
  rate(state);
}

// Rows with an 8-byte prefix (the raw-data layout), pixels read row by row
// behind each prefix: the same file seen with one pixel less per row.
void BM_BufferIOReadPrefixedRows(benchmark::State& state) {
  ensureFile();
  std::vector<fcomplex> buf(size_t(kPixels - 1) * kBlockLines);
  for (auto _ : state) {
    DataFile f;
    describe(f);
    f.NrOfPixelsPerLine = kPixels - 1;
    f.RowPrefix = 8;
    for (int l = 0; l < lines(); l += kBlockLines) {
      BufferIO io{&f, 0, kPixels - 1, l, kBlockLines, FLOAT_COMPLEX};
      benchmark::DoNotOptimize(io.readbuffer(buf.data()));
    }
    f.close();
  }
  rate(state);
}

// A window of columns (every row touched, a third of each row read): the
// access of the azimuth stage on a range-focused raster.
void BM_BufferIOReadColumnWindow(benchmark::State& state) {
  ensureFile();
  const int cols = kPixels / 3;
  std::vector<fcomplex> buf(size_t(cols) * kBlockLines);
  for (auto _ : state) {
    DataFile f;
    describe(f);
    for (int l = 0; l < lines(); l += kBlockLines) {
      BufferIO io{&f, kPixels / 3, cols, l, kBlockLines, FLOAT_COMPLEX};
      benchmark::DoNotOptimize(io.readbuffer(buf.data()));
    }
    f.close();
  }
  const double bytes = double(totalBytes()) / 3 * double(state.iterations());
  state.SetBytesProcessed(int64_t(bytes));
  state.counters["MB/s"] = benchmark::Counter(bytes / 1e6, benchmark::Counter::kIsRate);
}

BENCHMARK(BM_PlainFwrite)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(2);
BENCHMARK(BM_BufferIOWrite)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(2);
BENCHMARK(BM_BufferFileWrite)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(2);
BENCHMARK(BM_PlainFread)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(2);
BENCHMARK(BM_BufferIORead)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(2);
BENCHMARK(BM_BufferFileRead)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(2);
BENCHMARK(BM_BufferFileWindowRead)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(2);
BENCHMARK(BM_BufferIOReadPrefixedRows)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(2);
BENCHMARK(BM_BufferIOReadColumnWindow)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(2);

}  // namespace

int main(int argc, char** argv) {
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
  benchmark::RunSpecifiedBenchmarks();
  benchmark::Shutdown();
  std::error_code ec;
  std::filesystem::remove(scratch(), ec);
  return 0;
}
