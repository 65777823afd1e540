#include "core/ortog.h"

#include <algorithm>
#include <cerrno>
#include <cmath>
#include <cstdio>
#include <memory>
#include <string>
#include <vector>

#include "base/status.h"
#include "diag/report.h"
#include "diag/waitbar.h"
#include "numerics/fitting.h"
#include "numerics/interleaved_sums.h"
#include "product/general_sar.h"

namespace {

struct FileCloser {
  void operator()(std::FILE* f) const {
    if (f) std::fclose(f);
  }
};
using File = std::unique_ptr<std::FILE, FileCloser>;

// Degree-2 fit, or the highest degree the number of points allows.
bool fitSeries(const std::vector<double>& t, const std::vector<double>& v, double* coef) {
  coef[0] = coef[1] = coef[2] = 0.0;
  // Fewer blocks (or coincident times) than a parabola needs: lower degree.
  const int n = static_cast<int>(t.size());
  for (int degree = std::min(2, n - 1); degree >= 0; --degree) {
    if (polfit(t.data(), v.data(), n, coef, degree) == 0) return true;
    coef[0] = coef[1] = coef[2] = 0.0;
  }
  return false;
}

double evalPoly(const double* c, double u) { return c[0] + u * (c[1] + u * c[2]); }

double skewOf(double cross, double powI, double powQ) {
  const double den = powI + powQ;
  if (den <= 0.0) return 0.0;
  return std::asin(std::clamp(2.0 * cross / den, -1.0, 1.0));
}

std::size_t rowBytes(const OrtogRaster& r) {
  return static_cast<std::size_t>(r.prefixBytes) +
         static_cast<std::size_t>(r.samples) * sizeof(fcomplex);
}

long long rowStart(const OrtogRaster& r, long long row) {
  return r.headerOffset + row * static_cast<long long>(rowBytes(r));
}

// Recursive statistics of ortogN, kept from one call to the next.
struct OrtogNState {
  double meanI = 0, meanQ = 0, levelI = 0, levelQ = 0, cross = 0, powI = 0, powQ = 0;
};
OrtogNState g_ortogN;

constexpr double kKeep = 0.99;
constexpr double kTake = 1.0 - kKeep;  // 0.010000000000000009

// Geometry of a raw raster from its record.
int rasterFromRecord(const std::string& raw, OrtogRaster& r) {
  GeneralSAR gs;
  if (int st = gs.GSread(raw + ".hdr"); st != 0) return st;
  const ROI_Obj& roi = gs.roi.roi;
  r.lines = gs.dataFile.NrOfLinesPerImage > 0 ? gs.dataFile.NrOfLinesPerImage : roi.Lines;
  r.samples = gs.dataFile.NrOfPixelsPerLine > 0 ? gs.dataFile.NrOfPixelsPerLine : roi.Samples;
  r.prefixBytes = gs.dataFile.RowPrefix;
  r.headerOffset = gs.dataFile.HeaderOffset;
  r.slowStartTime = roi.SlowStartTime;
  r.slowTimeDelta = roi.SlowTimeDelta;
  return 0;
}

}  // namespace

int Ortog::estimate() {
  if (linesPerBlock > blockPitch) return 0;
  OrtogRaster r;
  if (int st = rasterFromRecord(rawFile, r); st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  return estimate(r);
}

int Ortog::apply_ortog() {
  OrtogRaster r;
  if (int st = rasterFromRecord(rawFile, r); st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  return apply_ortog(r);
}

int Ortog::estimate(const OrtogRaster& raster) {
  if (linesPerBlock > blockPitch) return 0;
  const int lpb = std::max(linesPerBlock, 1);
  const int pitch = std::max(blockPitch, 1);
  const int blocks = raster.lines > 0 ? (raster.lines + pitch - 1) / pitch : 0;
  if (blocks < 1 || raster.samples < 1) {
    ORV_REPORT("blocks are less than zero, raster info of the raw data file is probably wrong",
               REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  File f(std::fopen(rawFile.c_str(), "rb"));
  if (!f) {
    ORV_REPORT("File not opened!", REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  waitbar_open("Channel Orthogonalisation");

  const std::size_t m = static_cast<std::size_t>(lpb) * raster.samples;
  std::vector<fcomplex> block(m);
  std::vector<double> times, iMeans, qMeans, iLevels, qLevels, phases;
  for (int b = 0; b < blocks; ++b) {
    long long start = static_cast<long long>(b) * pitch;
    if (b == blocks - 1) start = raster.lines - lpb;
    if (start < 0) start = 0;
    const int nl = static_cast<int>(std::min<long long>(lpb, raster.lines - start));
    for (int l = 0; l < nl; ++l) {
      if (std::fseek(f.get(), rowStart(raster, start + l) + raster.prefixBytes, SEEK_SET) != 0 ||
          std::fread(&block[static_cast<std::size_t>(l) * raster.samples], sizeof(fcomplex),
                     raster.samples, f.get()) != static_cast<std::size_t>(raster.samples)) {
        ORV_REPORT("File reading failed!", REPORT_ERROR);
        return STATUS_READ_FAILED;
      }
    }
    const std::size_t count = static_cast<std::size_t>(nl) * raster.samples;
    double si = 0.0, sq = 0.0;
    for (std::size_t k = 0; k < count; ++k) {
      si += block[k].real();
      sq += block[k].imag();
    }
    const double mi = si / count, mq = sq / count;
    std::vector<float> I(count), Q(count);
    double pi = 0.0, pq = 0.0;
    for (std::size_t k = 0; k < count; ++k) {
      I[k] = block[k].real() - static_cast<float>(mi);
      Q[k] = block[k].imag() - static_cast<float>(mq);
      pi += static_cast<double>(I[k]) * I[k];
      pq += static_cast<double>(Q[k]) * Q[k];
    }
    const double li = std::sqrt(pi / count), lq = std::sqrt(pq / count);
    double ph = 0.0;
    if (lq > 1e-08) {
      const float ratio = static_cast<float>(li / lq);
      double cross = 0.0, ii = 0.0, qq = 0.0;
      for (std::size_t k = 0; k < count; ++k) {
        const float qs = Q[k] * ratio;
        cross += static_cast<double>(I[k]) * qs;
        ii += static_cast<double>(I[k]) * I[k];
        qq += static_cast<double>(qs) * qs;
      }
      ph = skewOf(cross, ii, qq);
    }
    times.push_back(static_cast<double>(start + lpb / 2) * raster.slowTimeDelta);
    iMeans.push_back(mi);
    qMeans.push_back(mq);
    iLevels.push_back(li);
    qLevels.push_back(lq);
    phases.push_back(ph);
    waitbar_update(0, 100.0f * (b + 1) / blocks);
  }
  waitbar_close();

  timeOrigin = raster.slowStartTime;
  if (!fitSeries(times, qMeans, qMean) || !fitSeries(times, iMeans, iMean) ||
      !fitSeries(times, qLevels, qLevel) || !fitSeries(times, iLevels, iLevel) ||
      !fitSeries(times, phases, phase)) {
    ORV_REPORT("Called function returned ERROR", REPORT_ERROR_CALL_TREE);
    return STATUS_BAD_CONDITION;
  }
  return 0;
}

void Ortog::apply_ortog(fcomplex* line, double t, int n) const {
  const double u = t - timeOrigin;
  const float mi = static_cast<float>(evalPoly(iMean, u));
  const float mq = static_cast<float>(evalPoly(qMean, u));
  const float li = static_cast<float>(evalPoly(iLevel, u));
  const float lq = static_cast<float>(evalPoly(qLevel, u));
  const double ph = evalPoly(phase, u);
  // A dead Q channel is left at its level instead of being blown up.
  const float ratio = lq > 1e-08f ? li / lq : 1.0f;
  const float s = static_cast<float>(std::sin(ph));
  const float invCos = static_cast<float>(1.0 / std::cos(ph));
  for (int k = 0; k < n; ++k) {
    const float a = line[k].real() - mi;
    const float b = (line[k].imag() - mq) * ratio;
    line[k] = fcomplex(a, (b - a * s) * invCos);
  }
}

int Ortog::apply_ortog(const OrtogRaster& raster) {
  File f(std::fopen(rawFile.c_str(), "r+b"));
  if (!f) {
    ORV_REPORT("File not opened!", REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  std::vector<fcomplex> line(std::max(raster.samples, 0));
  for (int r = 0; r < raster.lines; ++r) {
    const long long pos = rowStart(raster, r) + raster.prefixBytes;
    if (std::fseek(f.get(), pos, SEEK_SET) != 0 ||
        std::fread(line.data(), sizeof(fcomplex), line.size(), f.get()) != line.size()) {
      ORV_REPORT("File reading failed!", REPORT_ERROR);
      return STATUS_READ_FAILED;
    }
    apply_ortog(line.data(), raster.slowStartTime + r * raster.slowTimeDelta, raster.samples);
    if (std::fseek(f.get(), pos, SEEK_SET) != 0 ||
        std::fwrite(line.data(), sizeof(fcomplex), line.size(), f.get()) != line.size()) {
      ORV_REPORT("File writing failed!", REPORT_ERROR);
      return STATUS_WRITE_FAILED;
    }
  }
  return 0;
}

void ortogN_reset() { g_ortogN = OrtogNState{}; }


int ortogN(fcomplex* data, int pitch, int samples, int lines, int block) {
  if (samples < 1 || lines < 1) return 0;
  OrtogNState& st = g_ortogN;
  auto smooth = [block](double& state, double value) {
    state = block == 0 ? value : kKeep * state + kTake * value;
  };
  auto rowOf = [&](int l) { return data + static_cast<std::size_t>(l) * pitch; };
  // The sums of a line are independent of the other lines; the smoothed
  // statistics run through the lines in order. So each of the three sums
  // goes over all lines on all threads, and the statistics follow in a
  // short pass in line order (a line of block 0 restarts them; an empty
  // line leaves them as they are and passes unchanged).
  std::vector<double> a(lines), b(lines), c(lines);
  std::vector<float> smi(lines), smq(lines), ratio(lines), sinSkew(lines), invCos(lines);
  std::vector<char> empty(lines);
#pragma omp parallel for schedule(static)
  for (int l = 0; l < lines; ++l) {
    const fcomplex* row = rowOf(l);
    double sum[2];
    interleavedSums(0, samples, [row](int k, double (&v)[2]) {
      v[0] = row[k].real();
      v[1] = row[k].imag();
    }, sum);
    a[l] = sum[0] / samples;
    b[l] = sum[1] / samples;
  }
  for (int l = 0; l < lines; ++l) {
    if (block == 0) st.meanI = st.meanQ = 0.0;
    empty[l] = a[l] == 0.0;
    if (empty[l]) continue;
    smooth(st.meanI, a[l]);
    smooth(st.meanQ, b[l]);
    smi[l] = static_cast<float>(st.meanI);
    smq[l] = static_cast<float>(st.meanQ);
  }
#pragma omp parallel for schedule(static)
  for (int l = 0; l < lines; ++l) {
    if (empty[l]) continue;
    const fcomplex* row = rowOf(l);
    const float mi = smi[l], mq = smq[l];
    double sum[2];
    interleavedSums(0, samples, [row, mi, mq](int k, double (&v)[2]) {
      const float I = row[k].real() - mi, Q = row[k].imag() - mq;
      v[0] = static_cast<double>(I) * I;
      v[1] = static_cast<double>(Q) * Q;
    }, sum);
    a[l] = sum[0];
    b[l] = sum[1];
  }
  for (int l = 0; l < lines; ++l) {
    if (block == 0) st.levelI = st.levelQ = 0.0;
    if (empty[l]) continue;
    smooth(st.levelI, std::sqrt(a[l] / samples));
    smooth(st.levelQ, std::sqrt(b[l] / samples));
    ratio[l] = st.levelQ > 1e-08 ? static_cast<float>(st.levelI / st.levelQ) : 1.0f;
  }
#pragma omp parallel for schedule(static)
  for (int l = 0; l < lines; ++l) {
    if (empty[l]) continue;
    const fcomplex* row = rowOf(l);
    const float mi = smi[l], mq = smq[l], r = ratio[l];
    double sum[3];
    interleavedSums(0, samples, [row, mi, mq, r](int k, double (&v)[3]) {
      const float I = row[k].real() - mi, Q = (row[k].imag() - mq) * r;
      v[0] = static_cast<double>(I) * Q;
      v[1] = static_cast<double>(I) * I;
      v[2] = static_cast<double>(Q) * Q;
    }, sum);
    a[l] = sum[0];
    b[l] = sum[1];
    c[l] = sum[2];
  }
  for (int l = 0; l < lines; ++l) {
    if (block == 0) st.cross = st.powI = st.powQ = 0.0;
    if (empty[l]) continue;
    smooth(st.cross, a[l]);
    smooth(st.powI, b[l]);
    smooth(st.powQ, c[l]);
    // Block 0 runs on per-line values and leaves the skew alone.
    const double ph = block == 0 ? 0.0 : skewOf(st.cross, st.powI, st.powQ);
    sinSkew[l] = static_cast<float>(std::sin(ph));
    invCos[l] = static_cast<float>(1.0 / std::cos(ph));
  }
#pragma omp parallel for schedule(static)
  for (int l = 0; l < lines; ++l) {
    if (empty[l]) continue;
    fcomplex* row = rowOf(l);
    for (int k = 0; k < samples; ++k) {
      const float I = row[k].real() - smi[l], Q = (row[k].imag() - smq[l]) * ratio[l];
      row[k] = fcomplex(I, (Q - I * sinSkew[l]) * invCos[l]);
    }
  }
  return 0;
}
