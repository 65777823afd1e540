#include "core/stolt_interpolation.h"

#include <gtest/gtest.h>

#include <cmath>
#include <complex>
#include <cstring>
#include <numbers>
#include <random>
#include <vector>

#ifdef _OPENMP
#include <omp.h>
#endif

namespace {

constexpr double kC = 299792458.0;
constexpr double kPi = std::numbers::pi;

// Periodic band-limited signal of period n samples with unit point responses
// at the given fractional positions and a flat spectrum on |f| < band / 2
// (cycles per sample), sampled at t = r * step for r = 0 .. count - 1.
std::vector<fcomplex> bandLimited(int n, double band, const std::vector<double>& pos, int count,
                                  double step = 1.0) {
  std::vector<fcomplex> row(count);
  const int half = static_cast<int>(std::floor(band * n / 2.0));
  for (int r = 0; r < count; ++r) {
    std::complex<double> s = 0.0;
    for (double p : pos)
      for (int m = -half; m <= half; ++m) s += std::polar(1.0 / n, 2 * kPi * m * (r * step - p) / n);
    row[r] = fcomplex(static_cast<float>(s.real()), static_cast<float>(s.imag()));
  }
  return row;
}

// Error energy of `got` against `want` relative to the energy of `want`, dB.
double errorDb(const fcomplex* got, const std::vector<fcomplex>& want, float gain = 1.0f) {
  double e = 0.0, w = 0.0;
  for (std::size_t i = 0; i < want.size(); ++i) {
    e += std::norm(got[i] - gain * want[i]);
    w += std::norm(want[i]);
  }
  return 10.0 * std::log10(e / w);
}

// One azimuth line at zero Doppler: the Stolt mapping is the identity, so
// the kernels reduce to resampling the row spectrum onto the output grid.
AzimuthBlockPar zeroDopplerLine(int samples) {
  AzimuthBlockPar par;
  par.lines = 1;
  par.samples = samples;
  par.fc = 5.3e9;
  par.frg = 18.96e6;
  par.prf = 1680.0;
  par.Veq = 7100.0;
  par.Req = 850e3;
  par.AntennaLength = 10.0;
  par.bw = 0.8 * par.frg;
  return par;
}

TEST(StoltInterpolation, LeastSquaresTableResamplesTheRowSpectrum) {
  // 200 samples padded to 288: the 200 output wavenumbers fall at fractions
  // of the input step all over the table. The row must come back in place
  // (the pad offset moves the content to the middle of the window for the
  // interpolation and back), more exactly with 15 taps than with 3.
  const int ns = 200;
  const double dr = kC / (2 * 18.96e6);
  const std::vector<double> targets = {20.0, 60.4, 108.0, 140.3, 180.9};
  const auto want = bandLimited(ns, 0.8, targets, ns);
  const double kx = 0.0, kx2 = 0.0, dk = 0.0;
  double err[2];
  int h = 0;
  for (int taps : {1, 7}) {
    auto par = zeroDopplerLine(ns);
    par.interp = taps;
    par.pad = 0.4;  // padded = genpow(280) = 288, pad offset 44
    auto row = want;
    par.data = row.data();
    ASSERT_EQ(LSInterpWK(par, 288, 200, 200, &kx, &kx2, &dk, dr, 0.0, par.Req), 0);
    err[h++] = errorDb(row.data(), want);
  }
  EXPECT_LT(err[1], -30.0);
  EXPECT_LT(err[1], err[0] - 8.0);
  // Without padding the row fills the window and still comes back in place.
  auto par = zeroDopplerLine(ns);
  par.interp = 7;
  auto row = want;
  par.data = row.data();
  ASSERT_EQ(LSInterpWK(par, 200, 200, 200, &kx, &kx2, &dk, dr, 0.0, par.Req), 0);
  EXPECT_LT(errorDb(row.data(), want), -30.0);
}

TEST(StoltInterpolation, ChirpZoomResamplesTheRowSpectrum) {
  // The two-tap interpolator is exact for content at the middle of the
  // zoomed window and good near it.
  const int ns = 200;
  const double dr = kC / (2 * 18.96e6);
  const std::vector<double> targets = {101.3, 108.0, 114.6};
  const auto want = bandLimited(ns, 0.8, targets, ns);
  auto row = want;
  auto par = zeroDopplerLine(ns);
  par.interp = 1;
  par.pad = 0.4;  // not used by the chirp-z kernel
  par.data = row.data();
  const double kx = 0.0, kx2 = 0.0, dk = 0.0;
  ASSERT_EQ(ChirpInterpWK(par, 216, 200, 200, &kx, &kx2, &dk, dr, 0.0, par.Req), 0);
  EXPECT_LT(errorDb(row.data(), want), -30.0);
}

TEST(StoltInterpolation, ConjugatedProcessingReturnsTheConjugateRow) {
  // With conj set the transforms run backward (normalised, made up by the
  // scale S) on conjugated spectra: the zero-Doppler line comes back
  // conjugated.
  const int ns = 200;
  const double dr = kC / (2 * 18.96e6);
  const auto want = bandLimited(ns, 0.8, {104.2, 111.5}, ns);
  std::vector<fcomplex> conjWant(want.size());
  for (std::size_t i = 0; i < want.size(); ++i) conjWant[i] = std::conj(want[i]);
  const double kx = 0.0, kx2 = 0.0, dk = 0.0;
  for (int mode : {1, 7}) {
    auto par = zeroDopplerLine(ns);
    par.interp = mode;
    par.pad = 0.4;
    par.conj = 1;
    auto row = want;
    par.data = row.data();
    const int padded = mode == 1 ? 216 : 288;
    const int st = mode == 1
                       ? ChirpInterpWK(par, padded, 200, 200, &kx, &kx2, &dk, dr, 0.0, par.Req)
                       : LSInterpWK(par, padded, 200, 200, &kx, &kx2, &dk, dr, 0.0, par.Req);
    ASSERT_EQ(st, 0);
    EXPECT_LT(errorDb(row.data(), conjWant), -25.0) << mode;
  }
}

#ifdef _OPENMP
TEST(StoltInterpolation, ParallelRowsMatchTheSerialRunBitForBit) {
  // A squinted block with windows and whitening (gain sums over rows): the
  // result must not depend on the number of threads.
  const int nl = 64, ns = 128;
  std::mt19937 rng(7);
  std::normal_distribution<float> gauss(0.0f, 1.0f);
  std::vector<fcomplex> input(static_cast<std::size_t>(nl) * ns);
  for (auto& v : input) v = fcomplex(gauss(rng), gauss(rng));
  auto base = zeroDopplerLine(ns);
  base.lines = nl;
  base.dc = 600.0;
  base.whiten = 1;
  base.azw = 0.6;
  base.rgw = 0.75;
  base.azlook = base.aztrans = 0.8 * base.prf;
  base.rglook = base.rgtrans = 0.8 * base.frg;
  const double dr = kC / (2 * base.frg);
  const double k0 = 4 * kPi * base.fc / kC;
  const double kxc = 2 * kPi * base.dc / base.Veq;
  const double kzc = std::sqrt(k0 * k0 - kxc * kxc);
  std::vector<double> kx(nl), kx2(nl), dk(nl);
  for (int j = 0; j < nl; ++j) {
    const double f = base.dc + (j < nl / 2 ? j : j - nl) * base.prf / nl;
    kx[j] = 2 * kPi * f / base.Veq;
    kx2[j] = kx[j] * kx[j];
    dk[j] = k0 - std::sqrt(kx2[j] + kzc * kzc);
  }
  const int threadsBefore = omp_get_max_threads();
  for (int mode : {1, 5}) {
    std::vector<fcomplex> result[2];
    for (int t = 0; t < 2; ++t) {
      omp_set_num_threads(t == 0 ? 1 : 3);
      auto par = base;
      par.interp = mode;
      par.pad = 0.4;
      result[t] = input;
      par.data = result[t].data();
      const int padded = mode == 1 ? 130 : 180;
      const int st = mode == 1 ? ChirpInterpWK(par, padded, 128, 128, kx.data(), kx2.data(),
                                               dk.data(), dr, 30.0, par.Req)
                               : LSInterpWK(par, padded, 128, 128, kx.data(), kx2.data(),
                                            dk.data(), dr, 30.0, par.Req);
      ASSERT_EQ(st, 0);
    }
    EXPECT_EQ(0, std::memcmp(result[0].data(), result[1].data(),
                             result[0].size() * sizeof(fcomplex)))
        << mode;
  }
  omp_set_num_threads(threadsBefore);
}
#endif

}  // namespace
