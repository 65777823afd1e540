#include "sim/point_target.h"

#include <algorithm>
#include <cmath>
#include <cstring>

#include "base/constants.h"

namespace {

double toDb(double ratio) { return ratio > 0.0 ? 10.0 * std::log10(ratio) : -999.0; }

// Spectral bin after which zeros are inserted: the quietest bin of the
// (circularly smoothed) energy profile, so a band centred away from zero
// frequency is not cut.
int quietestBin(const std::vector<double>& energy) {
  const int n = static_cast<int>(energy.size());
  int best = n / 2;
  double bestE = -1.0;
  for (int k = 0; k < n; ++k) {
    double e = 0.0;
    for (int d = -2; d <= 2; ++d) e += energy[((k + d) % n + n) % n];
    if (bestE < 0.0 || e < bestE) {
      bestE = e;
      best = k;
    }
  }
  return best;
}

// Upsampled index of an original bin, with zeros inserted at `cut`.
int upsampledBin(int k, int n, int nu, int cut) {
  const int freq = k >= cut ? k - n : k;
  return ((freq % nu) + nu) % nu;
}

double parabolicOffset(double a, double b, double c) {
  const double den = a - 2.0 * b + c;
  return den != 0.0 ? 0.5 * (a - c) / den : 0.0;
}

// Measures an N x N window whose integer peak lies at its centre.
PtaResult measure(const std::vector<cdouble>& win, int n, double expectedPhase, const PtaOptions& opt) {
  PtaResult r;
  const int U = opt.upsample, nu = n * U;
  std::vector<cdouble> spec = win;
  simFft2(spec, n, n, -1);
  std::vector<double> eRow(n, 0.0), eCol(n, 0.0);
  for (int i = 0; i < n; ++i)
    for (int j = 0; j < n; ++j) {
      const double p = std::norm(spec[static_cast<std::size_t>(i) * n + j]);
      eRow[i] += p;
      eCol[j] += p;
    }
  const int cutRow = quietestBin(eRow), cutCol = quietestBin(eCol);
  std::vector<cdouble> up(static_cast<std::size_t>(nu) * nu, cdouble(0.0, 0.0));
  const bool absolute = std::isfinite(opt.azimuthCentroidPrf);
  for (int i = 0; i < n; ++i) {
    int ui = upsampledBin(i, n, nu, cutRow);
    if (absolute) {
      // Bin i at the frequency i / n + k (PRF units) nearest the centroid.
      const long k = std::lround(opt.azimuthCentroidPrf - static_cast<double>(i) / n);
      const long f = i + k * n;
      ui = static_cast<int>(((f % nu) + nu) % nu);
    }
    for (int j = 0; j < n; ++j)
      up[static_cast<std::size_t>(ui) * nu + upsampledBin(j, n, nu, cutCol)] = spec[static_cast<std::size_t>(i) * n + j];
  }
  simFft2(up, nu, nu, +1);
  const double scale = 1.0 / (static_cast<double>(n) * n);
  for (cdouble& v : up) v *= scale;
  // Peak within two pixels of the centre.
  int bi = nu / 2, bj = nu / 2;
  double bp = -1.0;
  for (int i = nu / 2 - 2 * U; i <= nu / 2 + 2 * U; ++i)
    for (int j = nu / 2 - 2 * U; j <= nu / 2 + 2 * U; ++j) {
      const double p = std::norm(up[static_cast<std::size_t>(i) * nu + j]);
      if (p > bp) {
        bp = p;
        bi = i;
        bj = j;
      }
    }
  auto at = [&](int i, int j) { return up[static_cast<std::size_t>((i + nu) % nu) * nu + (j + nu) % nu]; };
  const double di = parabolicOffset(std::abs(at(bi - 1, bj)), std::abs(at(bi, bj)), std::abs(at(bi + 1, bj)));
  const double dj = parabolicOffset(std::abs(at(bi, bj - 1)), std::abs(at(bi, bj)), std::abs(at(bi, bj + 1)));
  r.peakLine = (bi + di) / U;
  r.peakSample = (bj + dj) / U;
  r.peakAmplitude = std::abs(at(bi, bj));
  // Phase at the sub-bin peak from the local phase slopes.
  const double p0 = std::arg(at(bi, bj));
  const double si = std::arg(at(bi + 1, bj) * std::conj(at(bi - 1, bj))) / 2.0;
  const double sj = std::arg(at(bi, bj + 1) * std::conj(at(bi, bj - 1))) / 2.0;
  r.phase = std::remainder(p0 + di * si + dj * sj, 2.0 * consts::kPi);
  r.expectedPhase = expectedPhase;
  r.phaseError = std::remainder(r.phase - expectedPhase, 2.0 * consts::kPi);
  std::vector<double> az(nu), rg(nu);
  for (int k = 0; k < nu; ++k) {
    az[k] = std::norm(at(k, bj));
    rg[k] = std::norm(at(bi, k));
  }
  r.azimuth = profileMetrics(az, 1.0 / U, bi);
  r.range = profileMetrics(rg, 1.0 / U, bj);
  r.irwAzimuthM = r.azimuth.irwPixels * opt.azimuthSpacing;
  r.irwRangeM = r.range.irwPixels * opt.rangeSpacing;
  r.found = true;
  return r;
}

}  // namespace

IrMetrics profileMetrics(const std::vector<double>& p, double step, int peak) {
  IrMetrics m;
  const int n = static_cast<int>(p.size());
  const double p0 = p[peak], half = 0.5 * p0;
  int l = peak;
  while (l > 0 && p[l] >= half) --l;
  int h = peak;
  while (h < n - 1 && p[h] >= half) ++h;
  const double xl = l + (half - p[l]) / (p[l + 1] - p[l]);
  const double xh = h - (half - p[h]) / (p[h - 1] - p[h]);
  m.irwPixels = (xh - xl) * step;
  int nl = peak;
  while (nl > 0 && p[nl - 1] < p[nl]) --nl;
  int nh = peak;
  while (nh < n - 1 && p[nh + 1] < p[nh]) ++nh;
  double side = 0.0, inside = 0.0, outside = 0.0;
  for (int k = 0; k < n; ++k) {
    if (k > nl && k < nh) {
      inside += p[k];
    } else {
      outside += p[k];
      side = std::max(side, p[k]);
    }
  }
  m.pslrDb = toDb(side / p0);
  m.islrDb = toDb(outside / inside);
  return m;
}

double WindowSpec::weight(double u) const { return alpha + (1.0 - alpha) * std::cos(2.0 * consts::kPi * u); }

IrMetrics theoreticalMetrics(const WindowSpec& w, int extent, int upsample) {
  const int n = extent * upsample;
  std::vector<double> p(n);
  const int q = 4096;  // Simpson intervals over the band
  std::vector<double> wt(q + 1);
  for (int k = 0; k <= q; ++k) wt[k] = w.weight(-0.5 + static_cast<double>(k) / q) * ((k == 0 || k == q) ? 1 : (k % 2 ? 4 : 2));
  for (int i = 0; i < n; ++i) {
    const double x = (i - n / 2) / static_cast<double>(upsample) * w.bandFraction;  // resolution cells
    double re = 0.0, im = 0.0;
    for (int k = 0; k <= q; ++k) {
      const double u = -0.5 + static_cast<double>(k) / q;
      re += wt[k] * std::cos(2.0 * consts::kPi * u * x);
      im += wt[k] * std::sin(2.0 * consts::kPi * u * x);
    }
    p[i] = re * re + im * im;
  }
  return profileMetrics(p, 1.0 / upsample, n / 2);
}

bool BurstSpec::inBurst(double n) const {
  // Echo line k stands for the times of [k - 1/2, k + 1/2).
  const double into = std::fmod(n - firstLine + 0.5, cycle);
  return (into < 0.0 ? into + cycle : into) < echoes;
}

double BurstSpec::weight(double v, const WindowSpec& window) const {
  if (std::fabs(v) > 0.5 * window.bandFraction) return 0.0;
  const double f = centroidHz + v * prf;
  if (!inBurst(zeroDopplerLine + f / rateHz * prf)) return 0.0;
  // Band of the de-scalloping filter: the truncated sinc whose main lobe in
  // frequency spans four burst bandwidths.
  const double a = 4.0 * std::fabs(rateHz) * echoes / (prf * prf);
  double h = 1.0;
  for (int k = 1; k <= taps; ++k) {
    const double x = consts::kPi * a * k;
    h += 2.0 * std::sin(x) / x * std::cos(2.0 * consts::kPi * k * v);
  }
  double gain = std::fabs(h);
  if (speed > 0.0) {
    const double y = consts::kPi * v * prf * 0.5 * patternLength / speed;
    const double s = y == 0.0 ? 1.0 : std::sin(y) / y;
    gain /= s * s;
  }
  return gain * window.weight(v / window.bandFraction);
}

IrMetrics burstTheoreticalMetrics(const WindowSpec& window, const BurstSpec& burst, int extent, int upsample) {
  const int n = extent * upsample;
  // The gate is a step function of frequency: fine Simpson intervals keep
  // its edges within a small fraction of a burst bandwidth.
  const int q = 16384;
  std::vector<double> wt(q + 1);
  for (int k = 0; k <= q; ++k)
    wt[k] = burst.weight(-0.5 + static_cast<double>(k) / q, window) * ((k == 0 || k == q) ? 1 : (k % 2 ? 4 : 2));
  std::vector<double> p(n);
  for (int i = 0; i < n; ++i) {
    const double x = (i - n / 2) / static_cast<double>(upsample);  // lines
    double re = 0.0, im = 0.0;
    for (int k = 0; k <= q; ++k) {
      if (wt[k] == 0.0) continue;
      const double u = -0.5 + static_cast<double>(k) / q;
      re += wt[k] * std::cos(2.0 * consts::kPi * u * x);
      im += wt[k] * std::sin(2.0 * consts::kPi * u * x);
    }
    p[i] = re * re + im * im;
  }
  return profileMetrics(p, 1.0 / upsample, n / 2);
}

// ---------------------------------------------------------------- reader

ComplexRasterReader::~ComplexRasterReader() {
  if (f_) std::fclose(f_);
}

bool ComplexRasterReader::open(const std::string& path, long lines, long samples, bool bigEndian, long long header,
                               std::string& error, int rowPrefix) {
  if (f_) std::fclose(f_);
  f_ = std::fopen(path.c_str(), "rb");
  if (!f_) {
    error = "cannot open raster " + path;
    return false;
  }
  if (lines <= 0 || samples <= 0) {
    error = "raster " + path + ": lines and samples must be positive";
    return false;
  }
  std::fseek(f_, 0, SEEK_END);
  const long long size = std::ftell(f_);
  if (size < header + static_cast<long long>(lines) * (rowPrefix + samples * 8)) {
    error = "raster " + path + " holds " + std::to_string(size) + " bytes, fewer than " + std::to_string(lines) +
            " lines of " + std::to_string(samples) + " complex samples";
    return false;
  }
  lines_ = lines;
  samples_ = samples;
  big_ = bigEndian;
  header_ = header;
  prefix_ = rowPrefix;
  return true;
}

bool ComplexRasterReader::read(long line0, long sample0, int rows, int cols, std::vector<cdouble>& out,
                               std::string& error) const {
  out.assign(static_cast<std::size_t>(rows) * cols, cdouble(0.0, 0.0));
  std::vector<unsigned char> buf(static_cast<std::size_t>(cols) * 8);
  for (int i = 0; i < rows; ++i) {
    const long line = line0 + i;
    if (line < 0 || line >= lines_) continue;
    const long s0 = std::max(0L, sample0), s1 = std::min(samples_, sample0 + cols);
    if (s1 <= s0) continue;
    const long long off = header_ + static_cast<long long>(line) * (prefix_ + samples_ * 8) + prefix_ + s0 * 8;
    if (std::fseek(f_, static_cast<long>(off), SEEK_SET) != 0 ||
        std::fread(buf.data(), 8, static_cast<std::size_t>(s1 - s0), f_) != static_cast<std::size_t>(s1 - s0)) {
      error = "raster read failed at line " + std::to_string(line);
      return false;
    }
    for (long s = s0; s < s1; ++s) {
      unsigned char* b = buf.data() + (s - s0) * 8;
      if (big_) {
        std::reverse(b, b + 4);
        std::reverse(b + 4, b + 8);
      }
      float re = 0.0f, im = 0.0f;
      std::memcpy(&re, b, 4);
      std::memcpy(&im, b + 4, 4);
      out[static_cast<std::size_t>(i) * cols + (s - sample0)] = cdouble(re, im);
    }
  }
  return true;
}

// ---------------------------------------------------------------- analysis

PtaResult analysePointTarget(const ComplexRasterReader& image, double line, double sample, double expectedPhase,
                             const PtaOptions& opt) {
  PtaResult r;
  r.predictedLine = line;
  r.predictedSample = sample;
  r.expectedPhase = expectedPhase;
  const long pl = std::lround(line), ps = std::lround(sample);
  if (pl < 0 || pl >= image.lines() || ps < 0 || ps >= image.samples()) {
    r.message = "predicted position outside the image";
    return r;
  }
  std::vector<cdouble> area;
  std::string err;
  const int s = opt.search;
  if (!image.read(pl - s, ps - s, 2 * s + 1, 2 * s + 1, area, err)) {
    r.message = err;
    return r;
  }
  int bi = s, bj = s;
  double bp = -1.0;
  for (int i = 0; i <= 2 * s; ++i)
    for (int j = 0; j <= 2 * s; ++j) {
      const double p = std::norm(area[static_cast<std::size_t>(i) * (2 * s + 1) + j]);
      if (p > bp) {
        bp = p;
        bi = i;
        bj = j;
      }
    }
  if (bp <= 0.0) {
    r.message = "no signal around the predicted position";
    return r;
  }
  const long cl = pl - s + bi, cs = ps - s + bj;
  const int n = opt.window;
  std::vector<cdouble> win;
  if (!image.read(cl - n / 2, cs - n / 2, n, n, win, err)) {
    r.message = err;
    return r;
  }
  PtaResult m = measure(win, n, expectedPhase, opt);
  m.predictedLine = line;
  m.predictedSample = sample;
  m.peakLine += cl - n / 2;
  m.peakSample += cs - n / 2;
  m.errorLine = m.peakLine - line;
  m.errorSample = m.peakSample - sample;
  return m;
}

PtaResult analyseWindow(const std::vector<cdouble>& win, int rows, int cols, double expectedPhase,
                        const PtaOptions& opt) {
  int bi = 0, bj = 0;
  double bp = -1.0;
  for (int i = 0; i < rows; ++i)
    for (int j = 0; j < cols; ++j) {
      const double p = std::norm(win[static_cast<std::size_t>(i) * cols + j]);
      if (p > bp) {
        bp = p;
        bi = i;
        bj = j;
      }
    }
  const int n = opt.window;
  std::vector<cdouble> sub(static_cast<std::size_t>(n) * n, cdouble(0.0, 0.0));
  for (int i = 0; i < n; ++i)
    for (int j = 0; j < n; ++j) {
      const int si = bi - n / 2 + i, sj = bj - n / 2 + j;
      if (si >= 0 && si < rows && sj >= 0 && sj < cols)
        sub[static_cast<std::size_t>(i) * n + j] = win[static_cast<std::size_t>(si) * cols + sj];
    }
  PtaResult m = measure(sub, n, expectedPhase, opt);
  m.peakLine += bi - n / 2;
  m.peakSample += bj - n / 2;
  return m;
}
