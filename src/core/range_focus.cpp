#include "core/range_focus.h"

#include <algorithm>
#include <cerrno>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <future>
#include <new>
#include <string>
#include <utility>

#include "base/status.h"
#include "core/ortog.h"
#include "diag/report.h"
#include "diag/waitbar.h"
#include "product/data_file.h"

namespace {

struct FileCloser {
  void operator()(std::FILE* f) const {
    if (f) std::fclose(f);
  }
};
using File = std::unique_ptr<std::FILE, FileCloser>;

// Rows per correlation chunk: about 2 MiB of samples, so that the forward
// transform, the product and the backward transform work in cache.
constexpr std::size_t kChunkBytes = 2u << 20;
constexpr int kDefaultLinesPerBlock = 1024;

// x[i] *= h[i] over n complex samples, written on floats so that it
// vectorises without the complex-multiply library call.
void multiplyRow(fcomplex* row, const fcomplex* h, int n) {
  float* x = reinterpret_cast<float*>(row);
  const float* y = reinterpret_cast<const float*>(h);
#pragma omp simd
  for (int i = 0; i < n; ++i) {
    const float xr = x[2 * i], xi = x[2 * i + 1];
    const float yr = y[2 * i], yi = y[2 * i + 1];
    x[2 * i] = xr * yr - xi * yi;
    x[2 * i + 1] = xr * yi + xi * yr;
  }
}

int reportError(const char* message, int status, int line, const char* function) {
  orv_add_report(message, REPORT_ERROR, line, function, __FILE__);
  return status;
}
#define RF_FAIL(message, status) reportError((message), (status), __LINE__, __func__)

std::string wrongSwst(int line) {
  char text[64];
  std::snprintf(text, sizeof text, "SWST of LINE %d IS WRONG!", line);
  return text;
}

// Shift in samples of a line from its SWST prefix; false when it does not
// fit in [0, D] (a NaN prefix included).
bool lineShift(double value, int maxShift, int& shift) {
  if (!std::isfinite(value)) return false;
  const long s = std::lround(value);
  if (s < 0 || s > maxShift) return false;
  shift = static_cast<int>(s);
  return true;
}

// Moves the V valid samples of each row (pitch N) to position shift of a row
// of pitch O, zero before and after. O <= N, so rows can be rewritten in
// place from the first to the last.
void repackRows(fcomplex* data, int nrows, int pitchIn, int valid, int pitchOut,
                const int* shifts) {
  for (int r = 0; r < nrows; ++r) {
    fcomplex* src = data + static_cast<std::size_t>(r) * pitchIn;
    fcomplex* dst = data + static_cast<std::size_t>(r) * pitchOut;
    const int s = shifts ? shifts[r] : 0;
    std::memmove(dst + s, src, sizeof(fcomplex) * valid);
    std::fill(dst, dst + s, fcomplex(0.0f, 0.0f));
    std::fill(dst + s + valid, dst + pitchOut, fcomplex(0.0f, 0.0f));
  }
}

struct Sizes {
  int maxShift = 0;  // D
  int fftLength = 0; // N
  int valid = 0;     // V
  int outSamples = 0;  // O
};

int computeSizes(const RangeFocParams& p, const RangeFocWork& w, Sizes& z) {
  if (p.samples < 1 || p.lines < 0) return RF_FAIL("Bad raster size for range focusing", STATUS_BAD_PARAMETER);
  z.maxShift = range_max_shift(p.swstMin, p.swstMax, p.fs);
  if (z.maxShift < 0) return RF_FAIL("SWST_MAX is below SWST_MIN", STATUS_BAD_PARAMETER);
  z.fftLength = genpow(p.samples + z.maxShift, 1);
  z.valid = p.samples - w.replicaLen + 1;
  z.outSamples = z.valid + z.maxShift;
  return 0;
}

}  // namespace

int range_max_shift(double swstMin, double swstMax, double fs) {
  return static_cast<int>(std::lround((swstMax - swstMin) * fs));
}

int RangeCompressor::init(const fcomplex* replica, int replicaLen, int fftLength) {
  if (!replica || replicaLen < 1 || fftLength < replicaLen) return STATUS_BAD_CONDITION;
  n_ = fftLength;
  chunk_ = static_cast<int>(std::clamp<std::size_t>(kChunkBytes / (sizeof(fcomplex) * n_), 1, 256));
  conjSpectrum_.assign(n_, fcomplex(0.0f, 0.0f));
  std::copy_n(replica, replicaLen, conjSpectrum_.begin());
  int st = fft_c(n_, n_, 1, 1, FFT_FORWARD, FFT_NONE, conjSpectrum_.data(), conjSpectrum_.data());
  if (st != 0) return st;
  // The 1/N of the backward transform is folded into the replica spectrum.
  const float inv = 1.0f / static_cast<float>(n_);
  for (auto& h : conjSpectrum_) h = std::conj(h) * inv;
  st = fft_makep_c(forward_, n_, n_, chunk_, chunk_, FFT_FORWARD, FFT_NONE, 1);
  if (st != 0) return st;
  return fft_makep_c(backward_, n_, n_, chunk_, chunk_, FFT_BACKWARD, FFT_NONE, 1);
}

void RangeCompressor::compress(fcomplex* rows, int nrows) {
  for (int r0 = 0; r0 < nrows; r0 += chunk_) {
    const int nr = std::min(chunk_, nrows - r0);
    fcomplex* block = rows + static_cast<std::size_t>(r0) * n_;
    if (nr == chunk_) {
      pfft_c(forward_, block, block);
    } else {
      fft_c(n_, n_, nr, nr, FFT_FORWARD, FFT_NONE, block, block);
    }
    for (int r = 0; r < nr; ++r)
      multiplyRow(block + static_cast<std::size_t>(r) * n_, conjSpectrum_.data(), n_);
    if (nr == chunk_) {
      pfft_c(backward_, block, block);
    } else {
      fft_c(n_, n_, nr, nr, FFT_BACKWARD, FFT_NONE, block, block);
    }
  }
}

int rangefoc(const RangeFocParams& params, RangeFocWork& work) {
  if (!work.replica || work.replicaLen < 1)
    return RF_FAIL("No replica for range focusing", STATUS_BAD_PARAMETER);
  Sizes z;
  if (int st = computeSizes(params, work, z); st != 0) return st;
  if (z.valid <= 0)
    return RF_FAIL("Unable to range focus. Image too small with respet of chirp length",
                   STATUS_BAD_CONDITION);
  const int S = params.samples, N = z.fftLength, O = z.outSamples, lines = params.lines;
  work.outSamples = O;
  work.outLines = lines;
  work.inputOverwritten = false;

  RangeCompressor rc;
  if (int st = rc.init(work.replica, work.replicaLen, N); st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }

  RasterStream in, out;
  int P = 0, q = 0, passes = 0;
  std::vector<int> fileShift;
  std::vector<float> swst;  // SWST prefixes of the lines of a pass
  // File path: a pass is written while the next one is read and compressed,
  // from the other of two buffers.
  FFTBuffer spare;
  std::future<bool> pending;
  auto written = [&pending]() {
    if (!pending.valid()) return true;
    return pending.get();
  };
#define RF_FAIL_AFTER_WRITE(message, status)                                               \
  (written() ? RF_FAIL((message), (status))                                               \
             : RF_FAIL("File writing failed!", STATUS_WRITE_FAILED))
  if (work.incore) {
    if (work.data.size() < static_cast<std::size_t>(N) * lines ||
        work.shift.size() < static_cast<std::size_t>(lines))
      return RF_FAIL("In-core buffer not prepared for range focusing", STATUS_BAD_CONDITION);
    P = lines;
    work.linesPerBlock = lines;
    q = 0;
    passes = 1;
  } else {
    // An output row is never longer than an input line, so a pass written
    // over the file ends before the first line the next pass reads.
    const long long inLineBytes = (work.prefix ? static_cast<long long>(sizeof(float)) : 0) +
                                  static_cast<long long>(S) * static_cast<long long>(sizeof(fcomplex));
    work.inputOverwritten =
        params.overwriteInput &&
        static_cast<long long>(O) * static_cast<long long>(sizeof(fcomplex)) <= inLineBytes &&
        handOverFile(params.inputFile, params.outputFile);
    if (!in.open(work.inputOverwritten ? params.outputFile : params.inputFile, "rb"))
      return RF_FAIL("File not opened!", STATUS_NOT_OPENED);
    if (!out.open(params.outputFile, work.inputOverwritten ? "r+b" : "wb"))
      return RF_FAIL("File not opened!", STATUS_NOT_OPENED);
    P = work.linesPerBlock > 0 ? work.linesPerBlock : kDefaultLinesPerBlock;
    P = std::max(1, std::min(P, std::max(lines, 1)));
    q = lines / P;
    passes = lines % P ? q + 1 : q;
    try {
      work.data.assign(static_cast<std::size_t>(N) * P, fcomplex(0.0f, 0.0f));
      if (passes > 1) spare.assign(static_cast<std::size_t>(N) * P, fcomplex(0.0f, 0.0f));
      fileShift.assign(P, 0);
      swst.assign(P, 0.0f);
    } catch (const std::bad_alloc&) {
      return RF_FAIL("Memory allocation failed", STATUS_NO_MEMORY);
    }
  }

  waitbar_open("Range Focusing");
  const float total = static_cast<float>(std::max(passes, 1)) * static_cast<float>(P);
  for (int pass = 0; pass <= q; ++pass) {
    const int first = pass * P;
    const int nl = work.incore ? lines : std::min(P, lines - first);
    if (nl <= 0) continue;  // the final empty pass of an exact division
    fcomplex* data = work.data.data();
    const int* shifts = work.incore ? work.shift.data() : fileShift.data();

    if (!work.incore) {
      // The lines (SWST prefix, then samples) go straight into the rows, read
      // by the threads side by side in scatter reads of up to 256 lines.
      const long long prefixBytes = work.prefix ? static_cast<long long>(sizeof(float)) : 0;
      const long long lineBytes = prefixBytes + static_cast<long long>(S) * static_cast<long long>(sizeof(fcomplex));
      constexpr int kChunk = 256;
      const int chunks = (nl + kChunk - 1) / kChunk;
      std::vector<long long> got(chunks, 0);
#pragma omp parallel for schedule(static)
      for (int c = 0; c < chunks; ++c) {
        const int l0 = c * kChunk, count = std::min(kChunk, nl - l0);
        char* to[2 * kChunk];
        int64_t len[2 * kChunk];
        int pieces = 0;
        for (int l = l0; l < l0 + count; ++l) {
          if (work.prefix) {
            to[pieces] = reinterpret_cast<char*>(&swst[l]);
            len[pieces++] = prefixBytes;
          }
          to[pieces] = reinterpret_cast<char*>(data + static_cast<std::size_t>(l) * N);
          len[pieces++] = lineBytes - prefixBytes;
        }
        got[c] = std::max<int64_t>(0, in.preadv(to, len, pieces, (static_cast<long long>(first) + l0) * lineBytes));
      }
      // Bytes of the pass read without a gap: a short chunk is the end of the file.
      long long avail = 0;
      for (int c = 0; c < chunks; ++c) {
        avail += got[c];
        if (got[c] < static_cast<long long>(std::min(kChunk, nl - c * kChunk)) * lineBytes) break;
      }
      for (int l = 0; l < nl; ++l) {
        fcomplex* row = data + static_cast<std::size_t>(l) * N;
        std::fill(row + S, row + N, fcomplex(0.0f, 0.0f));  // zero padding
        fileShift[l] = 0;
        if (work.prefix) {
          if (avail < l * lineBytes + prefixBytes)
            return RF_FAIL_AFTER_WRITE("File reading failed!", STATUS_READ_FAILED);
          if (!lineShift((static_cast<double>(swst[l]) - params.swstMin) * params.fs, z.maxShift,
                         fileShift[l]))
            return RF_FAIL_AFTER_WRITE(wrongSwst(first + l).c_str(), STATUS_BAD_CONDITION);
        }
        if (avail < (l + 1) * lineBytes)
          return RF_FAIL_AFTER_WRITE("File reading failed!", STATUS_READ_FAILED);
      }
    }

    if (work.Flag_ortog) ortogN(data, N, S, nl, pass);

    // Correlate in steps of 100 rows for the wait bar.
    for (int r = 0; r < nl; r += 100) {
      const int nr = std::min(100, nl - r);
      rc.compress(data + static_cast<std::size_t>(r) * N, nr);
      waitbar_update(0, (static_cast<float>(first + r + nr)) / total * 100.0f);
    }
    repackRows(data, nl, N, z.valid, O, shifts);

    if (!work.incore) {
      if (!written()) return RF_FAIL("File writing failed!", STATUS_WRITE_FAILED);
      const long long rowBytes = static_cast<long long>(O) * static_cast<long long>(sizeof(fcomplex));
      const RasterStream* to = &out;
      pending = std::async(std::launch::async, [to, data, rowBytes, nl, first] {
        return to->pwriteRows(data, rowBytes, rowBytes, nl, first * rowBytes);
      });
      if (!spare.empty()) std::swap(work.data, spare);
    }
  }
  if (!written()) return RF_FAIL("File writing failed!", STATUS_WRITE_FAILED);
  waitbar_close();
#undef RF_FAIL_AFTER_WRITE

  if (!work.incore) {
    work.data = FFTBuffer();
    spare = FFTBuffer();
    const long long outBytes = static_cast<long long>(O) * static_cast<long long>(sizeof(fcomplex)) * lines;
    if (work.inputOverwritten && !out.truncate(outBytes))
      return RF_FAIL("File writing failed!", STATUS_WRITE_FAILED);
    if (out.close() != 0) return RF_FAIL("File writing failed!", STATUS_WRITE_FAILED);
  }
  return 0;
}

int init_buffer(const RangeFocParams& params, RangeFocWork& work) {
  Sizes z;
  if (int st = computeSizes(params, work, z); st != 0) return st;
  const int S = params.samples, N = z.fftLength, lines = params.lines;
  work.outSamples = z.outSamples;
  work.outLines = lines;
  try {
    work.shift.assign(lines, 0);
    work.data.assign(static_cast<std::size_t>(N) * lines, fcomplex(0.0f, 0.0f));
  } catch (const std::bad_alloc&) {
    return RF_FAIL("Memory allocation failed", STATUS_NO_MEMORY);
  }
  File in(std::fopen(params.inputFile.c_str(), "rb"));
  if (!in) return RF_FAIL("File not opened!", STATUS_NOT_OPENED);
  std::setvbuf(in.get(), nullptr, _IOFBF, 1 << 20);
  // Here the prefix counts in samples and the delay in pulse repetition
  // intervals.
  const double delayTime = params.prf > 0.0 ? params.delay / params.prf : 0.0;
  for (int l = 0; l < lines; ++l) {
    if (work.prefix) {
      float swst = 0.0f;
      if (std::fread(&swst, sizeof swst, 1, in.get()) != 1)
        return RF_FAIL("File reading failed!", STATUS_READ_FAILED);
      const double t = static_cast<double>(swst) / params.fs + delayTime;
      if (!lineShift((t - params.swstMin) * params.fs, z.maxShift, work.shift[l]))
        return RF_FAIL(wrongSwst(l).c_str(), STATUS_BAD_CONDITION);
    }
    if (std::fread(work.data.data() + static_cast<std::size_t>(l) * N, sizeof(fcomplex), S,
                   in.get()) != static_cast<std::size_t>(S))
      return RF_FAIL("File reading failed!", STATUS_READ_FAILED);
  }
  return 0;
}

int dest_buffer(const RangeFocParams& params, RangeFocWork& work) {
  File out(std::fopen(params.outputFile.c_str(), "wb"));
  if (!out) return RF_FAIL("File not opened!", STATUS_NOT_OPENED);
  const std::size_t count = std::min(
      static_cast<std::size_t>(std::max(work.outSamples, 0)) * std::max(work.outLines, 0),
      work.data.size());
  const bool ok = std::fwrite(work.data.data(), sizeof(fcomplex), count, out.get()) == count;
  work.data = FFTBuffer();
  work.shift = std::vector<int>();
  if (std::fclose(out.release()) != 0 || !ok)
    return RF_FAIL("File writing failed!", STATUS_WRITE_FAILED);
  return 0;
}
