#include "doppler/dc_polynomial.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <memory>
#include <new>
#include <string>
#include <vector>

#include "base/constants.h"
#include "base/status.h"
#include "core/fft.h"
#include "diag/environment.h"
#include "diag/report.h"
#include "doppler/dc_driver.h"
#include "doppler/dc_estimators.h"
#include "numerics/fitting.h"
#include "product/byte_order.h"
#include "product/data_file.h"

namespace {

constexpr double kPi = consts::kPi;
constexpr int kHistBins = 1024;
// Standard deviation reported for an empty set of estimates: never good.
constexpr double kNoStd = 1e10;

long roundHalfAway(double v) { return v < 0.0 ? -std::lround(-v) : std::lround(v); }

// Wrapped to (-1/2, 1/2].
double wrapHalf(double v) {
  double w = v - std::floor(v);
  if (w > 0.5) w -= 1.0;
  return w;
}

// The ambiguity chosen, how, and the spread of each estimator, on the
// standard output and in the process log.
void reportAmbiguityChoice(const DcEstState& st) {
  char text[512];
  if (st.ambFlag == 1) {
    std::snprintf(text, sizeof text,
                  "Doppler ambiguity %d from %s; MLBF: %d good estimates in %d blocks, mean %.3f, "
                  "std %.3f, amb %d; WDAR: %d blocks, mean %.3f, std %.3f, standard error %.3f, "
                  "amb %d; geometry: amb %d.",
                  st.ambiguity, st.ambiguitySource.c_str(), st.mlbfGood, st.mlbfGoodBlocks,
                  st.mlbfMean, st.mlbfGood > 0 ? st.mlbfStd : 0.0, st.mlbfAmbiguity,
                  static_cast<int>(st.wdarBlocks.size()), st.wdarMean,
                  st.wdarGood > 0 ? st.wdarStd : 0.0, st.wdarStdErr < kNoStd ? st.wdarStdErr : 0.0,
                  st.wdarAmbiguity, st.geomAmbiguity);
  } else {
    std::snprintf(text, sizeof text, "Doppler ambiguity %d from %s.", st.ambiguity,
                  st.ambiguitySource.c_str());
  }
  std::printf("\n%s\n", text);
  logWrite("%s\n", text);
}

int nextPow2(long n) {
  int p = 1;
  while (p < n && p < (1 << 30)) p *= 2;
  return p;
}

// Closes the estimator set-ups on every way out of a scope.
struct MlbfGuard {
  ~MlbfGuard() { multimlbf_close(); }
};
struct WdarGuard {
  ~WdarGuard() { wdar_close(); }
};

// Integrand of the Fisher information of a spectral shift: the azimuth power
// spectrum is S(v) = R0 (1 + 1/snr) + 2 R1 cos(2 pi v) + 2 R2 cos(4 pi v)
// (signal autocorrelation R0, R1, R2 plus white noise); its derivative is
// -4 pi (R1 sin(2 pi v) + 2 R2 sin(4 pi v)). The factor 16 pi^2 is applied by
// the caller.
struct ShiftInformation {
  double r0, r1, r2, snr;
  double operator()(double v) const {
    const double a = 2.0 * kPi * v;
    const double num = r1 * std::sin(a) + 2.0 * r2 * std::sin(2.0 * a);
    const double den = r0 * (1.0 + 1.0 / snr) + 2.0 * r1 * std::cos(a) + 2.0 * r2 * std::cos(2.0 * a);
    const double q = num / den;
    return q * q;
  }
};

// Trapezoid rule refined by halving until a refinement changes the sum by at
// most eps of it (checked from the sixth refinement on, so that a periodic
// integrand vanishing at the first nodes does not stop it early).
bool trapezoidIntegral(const ShiftInformation& f, double a, double b, double* result) {
  constexpr double eps = 1e-6;
  constexpr int maxSteps = 20;
  double s = 0.0, olds = 0.0;
  long points = 1;
  for (int j = 1; j <= maxSteps; ++j) {
    if (j == 1) {
      s = 0.5 * (b - a) * (f(a) + f(b));
    } else {
      const double del = (b - a) / points;
      double x = a + 0.5 * del, sum = 0.0;
      for (long k = 0; k < points; ++k, x += del) sum += f(x);
      s = 0.5 * (s + (b - a) * sum / points);
      points *= 2;
    }
    if (!std::isfinite(s)) return false;
    if (j > 5 && (std::fabs(s - olds) <= eps * std::fabs(olds) || (s == 0.0 && olds == 0.0))) {
      *result = s;
      return true;
    }
    olds = s;
  }
  return false;
}

}  // namespace

double dcPolyValue(const double poly[7], double r, double l) {
  return poly[0] + poly[1] * r + poly[2] * l + poly[3] * r * l + poly[4] * r * r +
         poly[5] * r * r * r + poly[6] * r * r * r * r;
}

double dcPhaseVariance(double snr, double nEff, double alpha) {
  const ShiftInformation f{dcBspline3(0.0), dcBspline3(alpha), dcBspline3(2.0 * alpha), snr};
  double x = 0.0;
  const bool ok = snr > 0.0 && nEff > 0.0 && trapezoidIntegral(f, 0.0, 1.0, &x) && x > 0.0;
  if (!ok) {
    std::printf("\nfunction getkrstd(): anomalous FAILURE (snr=%f) <==\n", snr);
    return 1e6;
  }
  return 1.0 / (x * nEff * 157.91367041742973);
}

int getkrstd(DcEstInput& input, DcEstState& st) {
  if (st.anLen <= 0.0 || input.prf <= 0.0) {
    ORV_REPORT("getkrstd: antenna length and PRF must be positive", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  const double alpha = 2.0 * input.velocity / (st.anLen * input.prf);
  const double samples = static_cast<double>(st.blocks) * st.blockl;
  for (DcBin& b : st.bins) {
    const double n = b.contrast > 0.0 ? samples / b.contrast : 0.0;
    b.krStd = dcPhaseVariance(b.snr, n, alpha);
  }
  return STATUS_OK;
}

int unwrapdcbin(DcEstState& st, double lin[3]) {
  lin[0] = lin[1] = lin[2] = 0.0;
  if (st.fftRgPrc <= 0.0 || st.fftAzPrc <= 0.0 || st.blocks < 1 || st.blockl < 1) {
    ORV_REPORT("unwrapdcbin: Fftrgprc, Fftazprc and the bin size must be positive", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  const int nbx = st.nBinsX, nby = st.nBinsY;
  const int nbins = std::min<int>(static_cast<int>(st.bins.size()), nbx * nby);
  if (nbins < 1) return STATUS_OK;
  int nx = nextPow2(static_cast<long>(std::floor(1.0 / st.fftRgPrc)));
  int ny = nextPow2(static_cast<long>(std::floor(1.0 / st.fftAzPrc)));
  nx = std::max(nx, nextPow2(nbx));
  ny = std::max(ny, nextPow2(nby));
  try {
    FFTBuffer grid(static_cast<std::size_t>(nx) * ny, fcomplex(0.0f, 0.0f));
    for (int i = 0; i < nbins; ++i) {
      const double p = 2.0 * kPi * st.bins[i].dcWrapped;
      grid[static_cast<std::size_t>(i / nbx) * nx + i % nbx] =
          fcomplex(static_cast<float>(std::cos(p)), static_cast<float>(std::sin(p)));
    }
    if (fft_c(nx, nx, ny, ny, FFT_FORWARD, FFT_FORWARD, grid.data(), grid.data()) != 0) {
      ORV_REPORT("unwrapdcbin: transform failed", REPORT_ERROR);
      return STATUS_BAD_CONDITION;
    }
    std::size_t k = 0;
    float best = -1.0f;
    for (std::size_t i = 0; i < grid.size(); ++i) {
      const float m = std::norm(grid[i]);
      if (m > best) {
        best = m;
        k = i;
      }
    }
    long u = static_cast<long>(k / nx), v = static_cast<long>(k % nx);
    if (u > ny / 2) u -= ny;
    if (v > nx / 2) v -= nx;
    const double ay = static_cast<double>(u) / ny / st.blockl;
    const double ax = static_cast<double>(v) / nx / st.blocks;
    const DcBin& first = st.bins[0];
    lin[0] = std::arg(grid[k]) / (2.0 * kPi) - (ay * first.line + ax * first.range);
    lin[1] = ax;
    lin[2] = ay;
  } catch (const std::bad_alloc&) {
    ORV_REPORT("unwrapdcbin: out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  return STATUS_OK;
}

int getdccoef(const DcEstInput& input, DcEstState& st, const double lin[3], double poly[7]) {
  for (int i = 0; i < 7; ++i) poly[i] = 0.0;
  const int width = input.samples;
  if (width < 1) {
    ORV_REPORT("getdccoef: raster line width below 1", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  int nvalid = 0;
  for (const DcBin& b : st.bins) nvalid += b.valid ? 1 : 0;
  if (nvalid < 8) {
    ORV_REPORT("getdccoef: fewer than 8 valid bins, no Doppler polynomial fit", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  NrVector<double> x(1, nvalid), y(1, nvalid), sig(1, nvalid), a(1, 7, 0.0);
  NrVector<int> ia(1, 7);
  NrMatrix<double> covar(1, 7, 1, 7);
  for (int i = 0; i < 7; ++i) ia[i + 1] = st.polMask[i] ? 1 : 0;
  // A term the bin positions cannot tell apart from the others (a range
  // power not below the number of distinct bin ranges, an azimuth term with
  // a single bin row) would make the normal equations singular and the
  // polynomial swing freely between the bins: it is left out.
  {
    std::vector<int> ranges, lines;
    for (const DcBin& b : st.bins)
      if (b.valid) {
        ranges.push_back(b.range);
        lines.push_back(b.line);
      }
    std::sort(ranges.begin(), ranges.end());
    std::sort(lines.begin(), lines.end());
    const long nr = std::unique(ranges.begin(), ranges.end()) - ranges.begin();
    const long nl = std::unique(lines.begin(), lines.end()) - lines.begin();
    // Terms 1, r, l, r l, r^2, r^3, r^4: distinct ranges and lines needed.
    const long needR[7] = {1, 2, 1, 2, 3, 4, 5};
    const long needL[7] = {1, 1, 2, 2, 1, 1, 1};
    for (int i = 0; i < 7; ++i)
      if (ia[i + 1] && (nr < needR[i] || nl < needL[i])) {
        ia[i + 1] = 0;
        ORV_REPORT("getdccoef: Doppler polynomial term " + std::to_string(i) +
                       " left out, too few distinct bin positions",
                   REPORT_WARNING);
      }
  }
  int j = 0;
  for (const DcBin& b : st.bins) {
    if (!b.valid) continue;
    ++j;
    x[j] = static_cast<double>(b.line) * width + b.range;
    y[j] = wrapHalf(b.dcWrapped - (lin[0] + lin[1] * b.range + lin[2] * b.line));
    sig[j] = std::sqrt(b.krStd);
  }
  // Range and line are scaled to about unity inside the fit to keep the
  // normal equations well conditioned; the coefficients are scaled back.
  const double sr = width;
  const double sl = std::max(1, input.lines);
  auto basis = [width, sr, sl](double xv, NrVector<double>& f, int) {
    const double l = std::floor(xv / width);
    const double r = (xv - l * width) / sr;
    const double ls = l / sl;
    f[1] = 1.0;
    f[2] = r;
    f[3] = ls;
    f[4] = r * ls;
    f[5] = r * r;
    f[6] = r * r * r;
    f[7] = r * r * r * r;
  };
  double chisq = 0.0;
  if (int s = lfitd(x, y, sig, nvalid, a, ia, 7, covar, &chisq, basis); s != 0) {
    ORV_REPORT_CALLED_ERROR();
    return s;
  }
  const double scale[7] = {1.0, 1.0 / sr, 1.0 / sl, 1.0 / (sr * sl), 1.0 / (sr * sr),
                           1.0 / (sr * sr * sr), 1.0 / (sr * sr * sr * sr)};
  for (int i = 0; i < 7; ++i) {
    const double linear = i < 3 ? lin[i] : 0.0;
    poly[i] = (a[i + 1] * scale[i] + linear) * (st.polMask[i] ? 1.0 : 0.0);
  }
  return STATUS_OK;
}

int getpercentile(const double* values, int n, double p, double* lo, double* hi) {
  std::vector<int> hist(kHistBins);
  double step = 0.0, min = 0.0;
  if (int s = make_hist(values, n, &step, &min, hist.data(), kHistBins); s != 0) {
    ORV_REPORT_CALLED_ERROR();
    return s;
  }
  const double target = p * n;
  int cum = 0, ilo = 0, ihi = kHistBins - 1;
  for (int b = 0; b < kHistBins; ++b) {
    cum += hist[b];
    if (cum >= target) {
      ilo = b;
      break;
    }
  }
  cum = 0;
  for (int b = kHistBins - 1; b >= 0; --b) {
    cum += hist[b];
    if (cum >= target) {
      ihi = b;
      break;
    }
  }
  *lo = min + ilo * step;
  *hi = min + ihi * step;
  return STATUS_OK;
}

int dcnastd(const double* values, int n, double varTh, double* mean, double* std, int* count) {
  *mean = 0.0;
  *std = kNoStd;
  *count = 0;
  if (n < 1) return STATUS_OK;
  for (int level = 1; level <= 9; ++level) {
    const double p = 0.05 * level;
    double lo = 0.0, hi = 0.0;
    if (int s = getpercentile(values, n, p, &lo, &hi); s != 0) {
      ORV_REPORT_CALLED_ERROR();
      return s;
    }
    double sum = 0.0;
    int c = 0;
    for (int i = 0; i < n; ++i)
      if (values[i] >= lo && values[i] <= hi) {
        sum += values[i];
        ++c;
      }
    if (c == 0) break;
    const double m = sum / c;
    double var = 0.0;
    for (int i = 0; i < n; ++i)
      if (values[i] >= lo && values[i] <= hi) var += (values[i] - m) * (values[i] - m);
    *mean = m;
    *std = std::sqrt(var / c);
    *count = c;
    if (*std <= varTh) break;
  }
  return STATUS_OK;
}

namespace {

bool blockInside(const DcEstState& st, const DcEstInput& input, int y, int x) {
  return st.blocks >= 1 && st.blockl >= 1 && x >= 0 && y >= 0 && x + st.blocks <= input.samples &&
         y + st.blockl <= input.lines;
}

// The block of st.blocks x st.blockl samples at sample x, line y into dst,
// in host byte order, from memory or through `file`. On failure the report
// text is left in `message`.
int readBlockInto(const DcEstState& st, const DcEstInput& input, const RasterStream& file, int y, int x,
                  fcomplex* dst, std::string& message) {
  const int ns = st.blocks, nl = st.blockl;
  if (!blockInside(st, input, y, x)) {
    message = "read_block: block of " + std::to_string(ns) + " x " + std::to_string(nl) + " at sample " +
              std::to_string(x) + ", line " + std::to_string(y) + " lies outside the raster " + input.rasterFile;
    return STATUS_BAD_CONDITION;
  }
  if (st.inMemory) {
    if (!st.data) {
      message = "read_block: no raster in memory";
      return STATUS_BAD_CONDITION;
    }
    for (int l = 0; l < nl; ++l)
      std::memcpy(dst + static_cast<std::size_t>(l) * ns,
                  st.data + static_cast<std::size_t>(y + l) * input.samples + x, ns * sizeof(fcomplex));
    return STATUS_OK;
  }
  const bool swap = (input.byteOrder == 1) != (get_endian() == kMsbFirst);
  const long long lineBytes = static_cast<long long>(ns) * static_cast<long long>(sizeof(fcomplex));
  for (int l = 0; l < nl; ++l) {
    const long long off = input.headerOffset +
                          (static_cast<long long>(y + l) * input.samples + x) * static_cast<long long>(sizeof(fcomplex));
    fcomplex* line = dst + static_cast<std::size_t>(l) * ns;
    if (file.pread(line, lineBytes, off) != lineBytes) {
      message = "File reading failed! " + input.rasterFile;
      return STATUS_READ_FAILED;
    }
    if (swap) {
      float* v = reinterpret_cast<float*>(line);
      for (int i = 0; i < 2 * ns; ++i) swp4(&v[i]);
    }
  }
  return STATUS_OK;
}

// The raster of a file-based estimation, open for the block reads.
int openRaster(const DcEstState& st, const DcEstInput& input, RasterStream& file) {
  if (st.inMemory || file.open(input.rasterFile, "rb")) return STATUS_OK;
  ORV_REPORT("File not opened! " + input.rasterFile, REPORT_ERROR);
  return STATUS_NOT_OPENED;
}

}  // namespace

int read_block(DcEstState& st, const DcEstInput& input, int y, int x) {
  const std::size_t n = static_cast<std::size_t>(std::max(st.blocks, 0)) * std::max(st.blockl, 0);
  try {
    if (st.blockBuf.size() < n) st.blockBuf.resize(n);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("read_block: out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  RasterStream file;
  std::string message;
  int s = STATUS_OK;
  // A block outside the raster is reported as such, before any file is opened.
  if (blockInside(st, input, y, x)) s = openRaster(st, input, file);
  if (s == STATUS_OK) s = readBlockInto(st, input, file, y, x, st.blockBuf.data(), message);
  if (s != STATUS_OK && !message.empty()) ORV_REPORT(message, REPORT_ERROR);
  return s;
}

int bestblocksproc(DcEstState& st, DcEstInput& input, const double poly[7]) {
  {
    MlbfGuard guard;
    if (int s = multimlbf_init(st); s != 0) {
      ORV_REPORT_CALLED_ERROR();
      return s;
    }
    if (int s = chirpZ_init(st); s != 0) {
      ORV_REPORT_CALLED_ERROR();
      return s;
    }
    const int n = static_cast<int>(st.mlbfBlocks.size());
    for (int i = 0; i < n; ++i) {
      const MlbfBlock& b = st.mlbfBlocks[i];
      if (int s = read_block(st, input, b.line - st.blockl / 2, b.range - st.blocks / 2); s != 0) {
        ORV_REPORT_CALLED_ERROR();
        return s;
      }
      std::printf("\nProcessing MLBF best block %d of %d.\n", i + 1, n);
      if (int s = multimlbf(st, i); s != 0) {
        ORV_REPORT_CALLED_ERROR();
        return s;
      }
    }
  }
  {
    WdarGuard guard;
    if (int s = wdar_init(st); s != 0) {
      ORV_REPORT_CALLED_ERROR();
      return s;
    }
    // The blocks are independent: each thread reads its own into its own
    // buffer and estimates it; the reports follow in block order.
    (void)poly;
    const int n = static_cast<int>(st.wdarBlocks.size());
    RasterStream file;
    if (int s = openRaster(st, input, file); s != 0) {
      ORV_REPORT_CALLED_ERROR();
      return s;
    }
    std::vector<int> readStatus(n, STATUS_OK), estimateStatus(n, STATUS_OK);
    std::vector<std::string> messages(n);
#pragma omp parallel
    {
      FFTBuffer work;
#pragma omp for schedule(dynamic, 1)
      for (int i = 0; i < n; ++i) {
        const WdarBlock& b = st.wdarBlocks[i];
        try {
          work.resize(static_cast<std::size_t>(st.blocks) * st.blockl);
        } catch (const std::bad_alloc&) {
          readStatus[i] = STATUS_NO_MEMORY;
          messages[i] = "read_block: out of memory";
          continue;
        }
        readStatus[i] = readBlockInto(st, input, file, b.line - st.blockl / 2, b.range - st.blocks / 2,
                                      work.data(), messages[i]);
        if (readStatus[i] == STATUS_OK) estimateStatus[i] = wdarInPlace(st, i, work.data());
      }
    }
    for (int i = 0; i < n; ++i) {
      if (readStatus[i] != STATUS_OK) {
        ORV_REPORT(messages[i], REPORT_ERROR);
        ORV_REPORT_CALLED_ERROR();
        return readStatus[i];
      }
      std::printf("\nProcessing WDAR best block %d of %d.\n", i + 1, n);
      if (estimateStatus[i] != STATUS_OK) {
        ORV_REPORT_CALLED_ERROR();
        return estimateStatus[i];
      }
    }
  }
  return STATUS_OK;
}

int estambiguity(DcEstState& st, DcEstInput& input, const double poly[7]) {
  if (input.prf <= 0.0) {
    ORV_REPORT("estambiguity: PRF must be positive", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  const double centre = dcPolyValue(poly, input.samples / 2, input.lines / 2);
  st.geomAmbiguity = static_cast<int>(roundHalfAway(st.geomDoppler / input.prf - centre));
  if (st.verbose) std::printf("Geometric computed DC gives ambiguity: %d \n", st.geomAmbiguity);
  if (st.ambFlag == 0) {
    st.ambiguity = 0;
    st.ambiguitySource = "NONE (Amb_flag 0)";
    reportAmbiguityChoice(st);
    return STATUS_OK;
  }
  if (st.ambFlag == 2) {
    st.ambiguity = st.geomAmbiguity;
    st.ambiguitySource = "GEOMETRY";
    reportAmbiguityChoice(st);
    return STATUS_OK;
  }
  if (st.ambFlag != 1) {
    ORV_REPORT("estambiguity: Amb_flag must be 0, 1 or 2, not " + std::to_string(st.ambFlag),
               REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  if (st.nBest == 0) {
    ORV_REPORT("estambiguity: no block wanted for the MLBF estimate (Nbestblocks 0)", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  if (st.patchs < 1 || st.patchl < 1 || st.cmWidth < 1 || st.cmHeight < 1 ||
      st.contrastMap.size() < static_cast<std::size_t>(st.cmWidth) * st.cmHeight) {
    ORV_REPORT("estambiguity: no contrast map to select blocks from", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }

  // Block selection: highest contrast for MLBF, lowest for WDAR.
  const double sx = static_cast<double>(st.blocks) / st.patchs;
  const double sy = static_cast<double>(st.blockl) / st.patchl;
  std::vector<MapPoint> pts;
  int found = 0;
  try {
    if (int s = topNpoints(st.contrastMap.data(), pts, st.nBest, st.cmWidth, st.cmHeight, sx, sy, &found);
        s != 0) {
      ORV_REPORT_CALLED_ERROR();
      return s;
    }
    std::printf("\nFound %d optimal blocks for MBLF estimation.\n", found);
    st.nBest = found;
    st.mlbfBlocks.assign(found, MlbfBlock{});
    for (int i = 0; i < found; ++i) {
      st.mlbfBlocks[i].range = pts[i].x * st.patchs;
      st.mlbfBlocks[i].line = pts[i].y * st.patchl;
    }
    for (float& v : st.contrastMap)
      if (v != 0.0f) v = 1.0f / v;
    int foundW = 0;
    if (int s = topNpoints(st.contrastMap.data(), pts, st.nWdar, st.cmWidth, st.cmHeight, sx, sy, &foundW);
        s != 0) {
      ORV_REPORT_CALLED_ERROR();
      return s;
    }
    std::printf("\nFound %d optimal blocks for WDAR estimation.\n", foundW);
    st.nWdar = foundW;
    st.wdarBlocks.assign(foundW, WdarBlock{});
    for (int i = 0; i < foundW; ++i) {
      st.wdarBlocks[i].range = pts[i].x * st.patchs;
      st.wdarBlocks[i].line = pts[i].y * st.patchl;
    }
  } catch (const std::bad_alloc&) {
    ORV_REPORT("estambiguity: out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }

  if (int s = bestblocksproc(st, input, poly); s != 0) {
    ORV_REPORT_CALLED_ERROR();
    return s;
  }

  // What remains after removing the wrapped polynomial is the ambiguity.
  // An MLBF estimate counts only when its beat peak stands kThr times above
  // everything else in the search window: a bright scatterer gives a clear
  // beat line, homogeneous clutter none (its beat spectrum is flat across
  // the window and the peak falls anywhere, mostly near zero beat, which
  // would pull the ambiguity towards the one of the fractional centroid).
  std::vector<double> mlbf, wd;
  int mlbfBlocksGood = 0;
  for (MlbfBlock& b : st.mlbfBlocks) {
    const double p = dcPolyValue(poly, b.range, b.line);
    int good = 0;
    for (std::size_t i = 0; i < b.estimates.size(); ++i) {
      double& e = b.estimates[i];
      e -= p;
      if (i < b.quality.size() && b.quality[i] >= st.kThr) {
        mlbf.push_back(e);
        ++good;
      }
    }
    b.flag = good > 0 ? 1 : 0;
    if (good > 0) ++mlbfBlocksGood;
  }
  for (WdarBlock& b : st.wdarBlocks) {
    b.value -= dcPolyValue(poly, b.range, b.line);
    wd.push_back(b.value);
  }
  if (int s = dcnastd(mlbf.data(), static_cast<int>(mlbf.size()), st.varTh, &st.mlbfMean, &st.mlbfStd,
                      &st.mlbfGood);
      s != 0) {
    ORV_REPORT_CALLED_ERROR();
    return s;
  }
  if (int s = dcnastd(wd.data(), static_cast<int>(wd.size()), st.varTh, &st.wdarMean, &st.wdarStd,
                      &st.wdarGood);
      s != 0) {
    ORV_REPORT_CALLED_ERROR();
    return s;
  }
  st.mlbfAmbiguity = static_cast<int>(roundHalfAway(st.mlbfMean));
  st.wdarAmbiguity = static_cast<int>(roundHalfAway(st.wdarMean));
  st.mlbfGoodBlocks = mlbfBlocksGood;

  // Confidence of each estimator: the standard error of its mean (MLBF
  // estimates of one block share the block's scatterers, so the blocks
  // count, not the estimates). MLBF holds when its spread is below varTh;
  // WDAR, whose single blocks spread by more than half a PRF on clutter,
  // holds when at least eight blocks give a standard error of at most
  // varTh / 3 (a wrong ambiguity then needs a three-sigma error).
  st.mlbfStdErr = mlbfBlocksGood > 0 ? st.mlbfStd / std::sqrt(static_cast<double>(mlbfBlocksGood)) : kNoStd;
  // The WDAR mean is trimmed until its spread falls below varTh, which says
  // little of its error; the standard error of the median of all blocks,
  // 1.25 sigma / sqrt(n) with sigma from the median absolute deviation, does.
  st.wdarStdErr = kNoStd;
  if (wd.size() >= 2) {
    std::vector<double> v = wd;
    std::nth_element(v.begin(), v.begin() + v.size() / 2, v.end());
    const double med = v[v.size() / 2];
    for (double& x : v) x = std::fabs(x - med);
    std::nth_element(v.begin(), v.begin() + v.size() / 2, v.end());
    st.wdarStdErr = 1.25 * 1.4826 * v[v.size() / 2] / std::sqrt(static_cast<double>(wd.size()));
  }
  const bool mlbfHolds = !mlbf.empty() && st.mlbfStd < st.varTh;
  const bool wdarHolds = wd.size() >= 8 && st.wdarStdErr <= st.varTh / 3.0;
  if (mlbfHolds) {
    if (wd.empty()) {
      std::printf("\nNo WDAR blocks available. Offset frequency estimation unavailable. \n");
    } else {
      // Frequency offset of WDAR against the MLBF ambiguity, for the record;
      // the phase-slope estimate itself carries no offset.
      st.wdarOffset = st.wdarMean - static_cast<double>(st.mlbfAmbiguity);
      st.wdarOffsetAvailable = 1;
    }
  }
  if (!wd.empty())
    std::printf("\nWDAR results: mean %f, std %f, Nest %d, amb %d.\n", st.wdarMean, st.wdarStd,
                st.wdarGood, st.wdarAmbiguity);
  else if (!mlbfHolds)
    std::printf("No WDAR blocks available. \n");
  if (!mlbf.empty())
    std::printf("\nMLBF results: mean %f, std %f, Nest %d, amb %d.\n", st.mlbfMean, st.mlbfStd,
                st.mlbfGood, st.mlbfAmbiguity);

  int status = STATUS_OK;
  if (mlbfHolds && wdarHolds) {
    if (st.mlbfAmbiguity == st.wdarAmbiguity) {
      st.ambiguity = st.mlbfAmbiguity;
      st.ambiguitySource = "MLBF and WDAR";
    } else if (st.wdarStdErr <= st.mlbfStdErr) {
      st.ambiguity = st.wdarAmbiguity;
      st.ambiguitySource = "WDAR (MLBF disagrees)";
    } else {
      st.ambiguity = st.mlbfAmbiguity;
      st.ambiguitySource = "MLBF (WDAR disagrees)";
    }
  } else if (mlbfHolds) {
    st.ambiguity = st.mlbfAmbiguity;
    st.ambiguitySource = "MLBF";
  } else if (wdarHolds) {
    st.ambiguity = st.wdarAmbiguity;
    st.ambiguitySource = "WDAR";
  } else {
    // Neither estimator is conclusive: the geometric ambiguity stands, and
    // the caller warns that the data did not resolve it.
    st.ambiguity = st.geomAmbiguity;
    st.ambiguitySource = "GEOMETRY (data estimates not conclusive)";
    status = STATUS_BAD_CONDITION;
  }
  reportAmbiguityChoice(st);
  return status;
}

int dcnapoly(DcEstInput& input, DcEstState& st, double poly[7]) {
  for (int i = 0; i < 7; ++i) poly[i] = 0.0;
  if (input.prf <= 0.0 || st.fs <= 0.0 || input.samples < 1) {
    ORV_REPORT("dcnapoly: PRF, sampling rate and line width must be positive", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  const int nb = static_cast<int>(st.bins.size());
  std::vector<int> mask;
  try {
    mask.assign(nb, 1);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("dcnapoly: out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY_ALT;
  }

  // Signal-to-noise ratio of each bin against the mean noise of the valid ones.
  double mu = 0.0;
  int nvalid = 0;
  for (const DcBin& b : st.bins)
    if (b.valid) {
      mu += b.noise;
      ++nvalid;
    }
  if (nvalid > 0) mu /= nvalid;
  for (int i = 0; i < nb; ++i) {
    DcBin& b = st.bins[i];
    if (!b.valid) {
      b.snr = 0.001;
      mask[i] = 1;
    } else if (mu <= 0.0) {
      b.snr = 1e10;
      mask[i] = 1;
    } else {
      b.snr = (b.power - mu) / mu;
      mask[i] = b.snr <= 0.0 ? 0 : 1;
    }
  }

  // Valid bins without signal take the means of their nearest kept neighbours.
  const double halfImage = std::hypot(input.samples / 2.0, input.lines / 2.0);
  for (int i = 0; i < nb; ++i) {
    DcBin& b = st.bins[i];
    if (!b.valid || mask[i] != 0) continue;
    double hx = st.blocks, hy = st.blockl;
    for (;;) {
      double sdc = 0.0, ssnr = 0.0;
      int c = 0;
      for (int j = 0; j < nb; ++j) {
        if (j == i || mask[j] != 1) continue;
        const DcBin& o = st.bins[j];
        if (std::fabs(static_cast<double>(o.range - b.range)) < hx &&
            std::fabs(static_cast<double>(o.line - b.line)) < hy) {
          sdc += o.dcWrapped;
          ssnr += o.snr;
          ++c;
        }
      }
      if (c > 0) {
        b.dcWrapped = sdc / c;
        b.snr = ssnr / c;
        break;
      }
      hx += st.blocks;
      hy += st.blockl;
      if (std::hypot(hx, hy) >= halfImage) {
        ORV_REPORT("dcnapoly: no bin with signal near a weak bin", REPORT_ERROR);
        return -1;
      }
    }
  }

  // Invalid bins take the phase and contrast of the nearest valid bin.
  for (int i = 0; i < nb; ++i) {
    DcBin& b = st.bins[i];
    if (b.valid) continue;
    double best = 1e50;
    int bj = -1;
    for (int j = 0; j < nb; ++j) {
      const DcBin& o = st.bins[j];
      if (!o.valid) continue;
      const double dx = o.range - b.range, dy = o.line - b.line;
      const double d = std::sqrt(dx * dx + dy * dy);
      if (d < best) {
        best = d;
        bj = j;
      }
    }
    if (bj >= 0) {
      b.dcWrapped = st.bins[bj].dcWrapped;
      b.contrast = st.bins[bj].contrast;
    }
  }

  if (int s = getkrstd(input, st); s != 0) {
    ORV_REPORT_CALLED_ERROR();
    return s;
  }
  double lin[3];
  if (int s = unwrapdcbin(st, lin); s != 0) {
    ORV_REPORT_CALLED_ERROR();
    return s;
  }
  if (int s = getdccoef(input, st, lin, poly); s != 0) {
    ORV_REPORT_CALLED_ERROR();
    return s;
  }

  const int amb = estambiguity(st, input, poly);
  if (amb == 0) {
    poly[0] += st.ambiguity;
  } else {
    if (amb != STATUS_BAD_CONDITION) ORV_REPORT_CALLED_ERROR();
    std::printf("\nWARNING: unresolved ambiguity!\n");
    // The data did not decide: the geometric ambiguity stands when the
    // estimators were run (0 when they could not be), and the record says so.
    st.ambiguity = amb == STATUS_BAD_CONDITION ? st.geomAmbiguity : 0;
    poly[0] += st.ambiguity;
  }

  // PRF units per sample and line to Hz per second.
  const double prf = input.prf, fs = st.fs;
  for (int i = 0; i < 7; ++i) poly[i] *= prf;
  poly[1] *= fs;
  poly[2] *= prf;
  poly[3] *= prf * fs;
  poly[4] *= fs * fs;
  poly[5] *= fs * fs * fs;
  poly[6] *= fs * fs * fs * fs;
  return STATUS_OK;
}
