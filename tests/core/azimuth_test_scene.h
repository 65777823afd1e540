#pragma once
// Range-compressed echoes of point targets for an ERS-like straight-line
// geometry, and a point-target analysis (sub-pixel peak, 3 dB width, PSLR,
// ISLR, peak phase) for the azimuth focusing tests.
#include <algorithm>
#include <cmath>
#include <complex>
#include <functional>
#include <numbers>
#include <vector>

#include "base/fcomplex.h"
#include "core/azimuth_focus.h"
#include "core/fft.h"

namespace azimuth_scene {

constexpr double kC = 299792458.0;
constexpr double kPi = std::numbers::pi;

inline double sinc(double u) { return u == 0.0 ? 1.0 : std::sin(kPi * u) / (kPi * u); }

struct Geometry {
  double fc = 5.3e9;
  double frg = 18.96e6;
  double prf = 1679.9;
  double V = 7100.0;
  double La = 10.0;    // antenna length, m
  double B = 15.55e6;  // range bandwidth
  double dc = 300.0;   // Doppler centroid, Hz
  double nearRange = 830e3;
  int samples = 512;
  int lines = 6792;
  double lambda() const { return kC / fc; }
  double fastStart() const { return 2.0 * nearRange / kC; }
  double squint() const { return std::asin(lambda() * dc / (2.0 * V)); }
  // Doppler rate of a target seen at beam centre at delay tau.
  double rateAt(double tau) const {
    const double cs = std::cos(squint());
    return -4.0 * V * V * cs * cs / (lambda() * kC * tau);
  }
  // Rate polynomial about tref (constant, linear, quadratic): the Taylor
  // series of rateAt, exact to (x/tref)^3.
  void ratePoly(double tref, double& f0, double& f1, double& f2) const {
    const double a = rateAt(tref) * tref;
    f0 = a / tref;
    f1 = -a / (tref * tref);
    f2 = a / (tref * tref * tref);
  }
  // Two-way amplitude pattern at Doppler f.
  double pattern(double f) const {
    const double th = std::asin(f * lambda() / (2.0 * V));
    const double s = sinc(La / lambda() * std::sin(th - squint()));
    return s * s;
  }
};

struct Target {
  double t0;  // zero-Doppler time, s (line 0 at time 0)
  double R0;  // closest range, m
  double amp = 1.0;
};

// Range-compressed raster (lines x samples): each line is the band-limited
// echo rect(B) in range frequency with the delay 2R/c and the carrier phase
// -4 pi R / lambda, weighted by the two-way pattern; echoes are kept within
// the PRF band around the centroid.
inline std::vector<fcomplex> simulate(const Geometry& g, const std::vector<Target>& targets) {
  const int N = g.samples;
  std::vector<fcomplex> img(static_cast<std::size_t>(g.lines) * N, fcomplex(0.0f, 0.0f));
  std::vector<std::complex<double>> lineSpectrum(N);
  FFTBuffer line(N);
  const double lam = g.lambda();
  for (int n = 0; n < g.lines; ++n) {
    const double t = n / g.prf;
    std::fill(lineSpectrum.begin(), lineSpectrum.end(), std::complex<double>(0.0, 0.0));
    bool any = false;
    for (const Target& tg : targets) {
      const double dt = t - tg.t0;
      const double R = std::sqrt(tg.R0 * tg.R0 + g.V * g.V * dt * dt);
      const double fd = -2.0 * g.V * g.V * dt / (lam * R);
      if (std::fabs(fd - g.dc) >= 0.5 * g.prf) continue;
      const double a = tg.amp * g.pattern(fd);
      const double tau = 2.0 * R / kC - g.fastStart();
      const double carrier = -4.0 * kPi * R / lam;
      for (int m = 0; m < N; ++m) {
        const double f = (m < N / 2 ? m : m - N) * g.frg / N;
        if (std::fabs(f) > g.B / 2.0) continue;
        lineSpectrum[m] += std::polar(a, carrier - 2.0 * kPi * f * tau);
      }
      any = true;
    }
    if (!any) continue;
    for (int m = 0; m < N; ++m) line[m] = fcomplex(lineSpectrum[m]);
    fft_c(N, N, 1, 1, FFT_BACKWARD_NORMALISED, FFT_NONE, line.data(), line.data());
    std::copy(line.begin(), line.end(), img.begin() + static_cast<std::ptrdiff_t>(n) * N);
  }
  return img;
}

struct Profile {
  double width = 0.0;  // 3 dB width, pixels
  double pslr = 0.0;   // dB
  double islr = 0.0;   // dB
};

// Metrics of a power profile sampled `ppp` points per pixel with its peak
// at index p; sidelobes counted within `span` pixels of the peak.
inline Profile profileMetrics(const std::vector<double>& pw, int p, int ppp, double span) {
  Profile r;
  const int n = static_cast<int>(pw.size());
  const double peak = pw[p];
  auto cross = [&](int dir) {
    int i = p;
    while (i + dir >= 0 && i + dir < n && pw[i + dir] > peak / 2.0) i += dir;
    if (i + dir < 0 || i + dir >= n) return static_cast<double>(i);
    const double a = pw[i], b = pw[i + dir];
    return i + dir * (a - peak / 2.0) / (a - b);
  };
  r.width = (cross(1) - cross(-1)) / ppp;
  int lo = p, hi = p;
  while (lo > 0 && pw[lo - 1] < pw[lo]) --lo;
  while (hi < n - 1 && pw[hi + 1] < pw[hi]) ++hi;
  const int s = static_cast<int>(span * ppp);
  double side = 0.0, sideMax = 0.0, main = 0.0;
  for (int i = std::max(0, p - s); i <= std::min(n - 1, p + s); ++i) {
    if (i >= lo && i <= hi) {
      main += pw[i];
    } else {
      side += pw[i];
      sideMax = std::max(sideMax, pw[i]);
    }
  }
  r.pslr = 10.0 * std::log10(sideMax / peak);
  r.islr = 10.0 * std::log10(side / main);
  return r;
}

// Profile of the impulse response of a spectral weight w(u), u in cycles
// per sample (-0.5..0.5), sampled `ppp` points per pixel over +-half pixels.
inline Profile theoryProfile(const std::function<double(double)>& w, int ppp = 16,
                             int half = 32, double span = 20.0) {
  const int nf = 4096;
  std::vector<double> wu(nf), u(nf);
  for (int q = 0; q < nf; ++q) {
    u[q] = -0.5 + (q + 0.5) / nf;
    wu[q] = w(u[q]);
  }
  std::vector<double> pw(2 * half * ppp + 1);
  for (std::size_t i = 0; i < pw.size(); ++i) {
    const double x = (static_cast<double>(i) - half * ppp) / ppp;
    std::complex<double> h = 0.0;
    for (int q = 0; q < nf; ++q)
      if (wu[q] != 0.0) h += wu[q] * std::polar(1.0, 2.0 * kPi * u[q] * x);
    pw[i] = std::norm(h);
  }
  return profileMetrics(pw, half * ppp, ppp, span);
}

struct PointMeasure {
  double row = 0.0, col = 0.0;  // peak position, pixels
  double phase = 0.0;           // radians, at the peak
  double amplitude = 0.0;       // at the peak
  Profile az, rg;
};

// Finds the strongest sample within `search` pixels of (row, col), cuts a
// 64 x 64 patch around it, brings its spectrum to baseband, upsamples 16x by
// zero padding and measures the peak (parabolic refinement), the phase at
// the peak and the cuts through it.
inline PointMeasure measure(const fcomplex* img, int rows, int cols, double row, double col,
                            int search = 4) {
  constexpr int P = 64, U = 16, M = P * U;
  int br = static_cast<int>(std::lround(row)), bc = static_cast<int>(std::lround(col));
  float best = -1.0f;
  const int r0s = br, c0s = bc;
  for (int r = r0s - search; r <= r0s + search; ++r)
    for (int c = c0s - search; c <= c0s + search; ++c) {
      if (r < 0 || r >= rows || c < 0 || c >= cols) continue;
      const float v = std::norm(img[static_cast<std::size_t>(r) * cols + c]);
      if (v > best) {
        best = v;
        br = r;
        bc = c;
      }
    }
  const int pr = std::clamp(br - P / 2, 0, rows - P), pc = std::clamp(bc - P / 2, 0, cols - P);
  std::vector<std::complex<double>> patch(P * P);
  for (int r = 0; r < P; ++r)
    for (int c = 0; c < P; ++c)
      patch[r * P + c] = std::complex<double>(img[static_cast<std::size_t>(pr + r) * cols + pc + c]);
  // Spectral centres along each axis from the lag-one correlations.
  std::complex<double> ca = 0.0, cr = 0.0;
  for (int r = 0; r < P; ++r)
    for (int c = 0; c < P; ++c) {
      if (r + 1 < P) ca += patch[(r + 1) * P + c] * std::conj(patch[r * P + c]);
      if (c + 1 < P) cr += patch[r * P + c + 1] * std::conj(patch[r * P + c]);
    }
  const double fa = std::arg(ca) / (2.0 * kPi), fr = std::arg(cr) / (2.0 * kPi);
  FFTBuffer buf(P * P), big(static_cast<std::size_t>(M) * M, fcomplex(0.0f, 0.0f));
  for (int r = 0; r < P; ++r)
    for (int c = 0; c < P; ++c)
      buf[r * P + c] = fcomplex(patch[r * P + c] *
                                std::polar(1.0, -2.0 * kPi * (fa * (r - P / 2) + fr * (c - P / 2))));
  fft_c(P, P, P, P, FFT_FORWARD, FFT_FORWARD, buf.data(), buf.data());
  for (int r = 0; r < P; ++r)
    for (int c = 0; c < P; ++c) {
      const int R = r < P / 2 ? r : r + M - P;
      const int C = c < P / 2 ? c : c + M - P;
      big[static_cast<std::size_t>(R) * M + C] = buf[r * P + c];
    }
  fft_c(M, M, M, M, FFT_BACKWARD_NORMALISED, FFT_BACKWARD_NORMALISED, big.data(), big.data());
  std::size_t imax = 0;
  float vmax = -1.0f;
  for (std::size_t i = 0; i < big.size(); ++i) {
    const float v = std::norm(big[i]);
    if (v > vmax) {
      vmax = v;
      imax = i;
    }
  }
  const int ur = static_cast<int>(imax / M), uc = static_cast<int>(imax % M);
  auto pwAt = [&](int r, int c) {
    return static_cast<double>(std::norm(big[static_cast<std::size_t>((r + M) % M) * M + (c + M) % M]));
  };
  auto refine = [](double a, double b, double c) {
    const double d = a - 2.0 * b + c;
    return d != 0.0 ? 0.5 * (a - c) / d : 0.0;
  };
  const double dr = refine(pwAt(ur - 1, uc), pwAt(ur, uc), pwAt(ur + 1, uc));
  const double dcol = refine(pwAt(ur, uc - 1), pwAt(ur, uc), pwAt(ur, uc + 1));
  PointMeasure m;
  m.row = pr + (ur + dr) / U;
  m.col = pc + (uc + dcol) / U;
  // Phase at the peak with the baseband shift put back.
  const double rr = (ur + dr) / U - P / 2, cc = (uc + dcol) / U - P / 2;
  m.amplitude = std::abs(big[imax]);
  m.phase = std::arg(std::complex<double>(big[imax]) *
                     std::polar(1.0, 2.0 * kPi * (fa * rr + fr * cc)));
  std::vector<double> az(M), rg(M);
  for (int i = 0; i < M; ++i) {
    az[i] = pwAt(i, uc);
    rg[i] = pwAt(ur, i);
  }
  m.az = profileMetrics(az, ur, U, 20.0);
  m.rg = profileMetrics(rg, uc, U, 20.0);
  return m;
}

// Scenes focused through the azimuth block driver.

// Configuration of the point-target scenes: 4096-line blocks with a full
// azimuth overlap of 1400 lines (longer than the 1314-line aperture),
// 256-sample range sub-blocks with a full overlap of 64.
inline AzimuthFocusConf sceneConf(const Geometry& g, int interp = 0, double pad = 0.0) {
  AzimuthFocusConf c;
  c.PerformInterpolation = interp;
  c.StoltPadding = pad;
  c.AntennaLength = g.La;
  c.WhiteningFlag = 0;
  c.RangeWindowHammingParameter = 0.75;
  c.AzimuthWindowHammingParameter = 0.6;
  c.RangeLookBandwidth = g.B;
  c.RangeTransitionBandwidth = g.B;
  c.AzimuthLookBandwidth = 0.8 * g.prf;
  c.AzimuthTransitionBandwidth = 0.8 * g.prf;
  c.SamplesInBlock = 256;
  c.LinesInBlock = 4096;
  c.RangeOverlap = 32;
  c.AzimuthOverlap = 700;
  c.ApplyAzShift = g.lines;    // automatic
  c.ApplyRgShift = g.samples;  // automatic
  return c;
}

inline void fillScene(const Geometry& g, AzimuthFocusFiles& files, AzimuthFocusScene& scene) {
  files.frg_hz = g.frg;
  files.fc_hz = g.fc;
  files.prf_hz = g.prf;
  files.FastStartTime = g.fastStart();
  files.bandwidth_hz = g.B;
  files.SlowStartTime = 0.0;
  scene.samples = g.samples;
  scene.lines = g.lines;
  const double tref = g.fastStart() + 0.5 * g.samples / g.frg;
  scene.polyDC[0] = g.dc;
  scene.polyDC[7] = tref;
  scene.polyDC[8] = 0.0;
  g.ratePoly(tref, scene.polyFR[0], scene.polyFR[1], scene.polyFR[4]);
  scene.polyFR[7] = tref;
}

// Output pixels (row, col) of the targets, placed in the middle of blocks and
// sub-blocks and on their seams (output row 2696, output columns 192, 384).
inline const double kPixels[][2] = {{1000.3, 100.2},  {2695.6, 191.7}, {2000.0, 384.4},
                             {4000.7, 300.5},  {2696.2, 50.0},  {3500.4, 250.3},
                             {4700.1, 400.0}};

// Targets whose zero-Doppler positions fall near kPixels, given the
// annotation of a focused scene.
inline std::vector<Target> placeTargets(const Geometry& g, double firstLine, double firstSample) {
  std::vector<Target> t;
  for (const auto& p : kPixels)
    t.push_back({firstLine + p[0] / g.prf, (firstSample + p[1] / g.frg) * kC / 2.0, 1.0});
  return t;
}

}  // namespace azimuth_scene
