// Doppler rate drifting along the azimuth time of a block: the drift of the
// equivalent speed seen by one range sub-block, and the azimuth resampling
// that makes the block look flown at the speed of its centre row.
#include <algorithm>
#include <cmath>
#include <vector>

#include "base/constants.h"
#include "core/azimuth_block.h"

namespace {

constexpr double kC = consts::kSpeedOfLight;
constexpr double kPi = consts::kPi;

// Below this phase (rad) that one speed would leave on the first and last
// rows the drift of a block is left alone: the resampling costs two passes
// over the block, and near zero Doppler its position error is below a
// hundredth of a line.
constexpr double kPhaseGate = 1.0 * kPi / 180.0;

// An orbit changes the speed of the range histories by a few 1e-6 per
// second; a faster change of the rate polynomial comes from an azimuth
// trend of the centroid it was taken at (a differently squinted point,
// not a drift of the speed), and is left alone.
constexpr double kMaxDrift = 2.5e-5;

// Half length of the band-limited derivative; its Hann taper keeps the
// response within 1 % of the ideal one up to 0.4 of the sampling rate.
constexpr int kTaps = 8;

}  // namespace

WKRateDrift wk_rate_drift(const AzimuthBlockPar& par) {
  WKRateDrift d;
  if (par.fr0y == 0.0 && par.fr1y == 0.0) return d;
  AzimuthBlockPar p = par;
  p.data = nullptr;
  if (MyComputeEqPar(p) != 0) return d;
  const double V = p.Veq, Req = p.Req;
  // The rate at the sub-block centre goes with the square of the speed
  // (the equivalent speed of MyComputeEqPar also follows the range slope
  // of the rate, which is not a change of the range histories).
  const double x = par.t0 + (par.samples / 2) / par.frg - par.trg0;
  const double rate = par.fr0 + x * (par.fr1 + x * (par.fr2 + x * par.fr3));
  if (rate == 0.0) return d;
  d.alpha = 0.5 * (par.fr0y + par.fr1y * x) / rate;

  const double v = par.dc * kC / par.fc / 2.0;
  if (std::fabs(v) >= V) return d;
  const double cs = std::sqrt(1.0 - (v / V) * (v / V));
  // Equivalent range of the sub-block centre: Req refers to the middle of
  // the sub-block without Stolt mapping, to its near edge with it.
  const double dr = kC / (2.0 * par.frg);
  const double Rq = Req + (par.interp == 0 ? 0.0 : cs * (par.samples / 2) * dr);
  // On the hyperbola sqrt(Rq^2 + V^2 u^2) the centroid is seen at u with
  // -V^2 u / R = v.
  d.beamLead = -Rq * v / (cs * V * V);

  // Effect of one speed for the whole block on its edge rows.
  const double delta = std::fabs(d.alpha) * (par.lines / 2) / par.prf;
  const double k0 = 4.0 * kPi * par.fc / kC;
  const double kx = 2.0 * kPi * par.dc / V;
  const double kz = std::sqrt(k0 * k0 - kx * kx);
  const double phase = Rq * kx * kx / kz * delta;
  d.active = phase > kPhaseGate && std::fabs(d.alpha) < kMaxDrift;
  
  return d;
}

void wk_resample_rows(const fcomplex* src, int srcPitch, fcomplex* dst, int dstPitch, int lines,
                      int n, double prf, double alpha, double offset, double lead,
                      const double* centroidHz) {
  // Band-limited derivative about the centroid: taps (-1)^(k+1)/k, tapered,
  // modulated by exp(-j 2 pi fdc k / prf) per column (k = 1..kTaps; the
  // taps of -k are the negatives of the conjugate-modulated ones).
  std::vector<fcomplex> plus(static_cast<std::size_t>(kTaps) * n), minus(plus.size());
  std::vector<double> omega(n);
  for (int i = 0; i < n; ++i) omega[i] = 2.0 * kPi * centroidHz[i] / prf;
  for (int k = 1; k <= kTaps; ++k) {
    const double w = std::cos(kPi * k / (2.0 * (kTaps + 1)));
    const double dk = (k % 2 ? 1.0 : -1.0) / k * w * w;
    for (int i = 0; i < n; ++i) {
      double s, c;
      wk_sincos(omega[i] * k, s, c);
      plus[static_cast<std::size_t>(k - 1) * n + i] = fcomplex(static_cast<float>(dk * c),
                                                               static_cast<float>(-dk * s));
      minus[static_cast<std::size_t>(k - 1) * n + i] = fcomplex(static_cast<float>(-dk * c),
                                                                static_cast<float>(-dk * s));
    }
  }
  const double centre = lines / 2;
#pragma omp parallel
  {
    std::vector<fcomplex> acc(n);
#pragma omp for schedule(static)
    for (int j = 0; j < lines; ++j) {
      const double t = (j - centre) / prf + offset;
      const double e = alpha * (t * t - lead * lead) / 2.0 * prf;  // rows
      const fcomplex* row = src + static_cast<std::size_t>(j) * srcPitch;
      fcomplex* out = dst + static_cast<std::size_t>(j) * dstPitch;
      std::fill(acc.begin(), acc.end(), fcomplex(0.0f, 0.0f));
      for (int k = 1; k <= kTaps; ++k) {
        if (j + k < lines) {
          const fcomplex* r = src + static_cast<std::size_t>(j + k) * srcPitch;
          const fcomplex* h = plus.data() + static_cast<std::size_t>(k - 1) * n;
          for (int i = 0; i < n; ++i) acc[i] += h[i] * r[i];
        }
        if (j - k >= 0) {
          const fcomplex* r = src + static_cast<std::size_t>(j - k) * srcPitch;
          const fcomplex* h = minus.data() + static_cast<std::size_t>(k - 1) * n;
          for (int i = 0; i < n; ++i) acc[i] += h[i] * r[i];
        }
      }
      const float ef = static_cast<float>(e);
      for (int i = 0; i < n; ++i)
        out[i] = wk_rotate(row[i], omega[i] * e) + ef * acc[i];
    }
  }
}
