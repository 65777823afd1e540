#include "numerics/filter_design.h"

#include <gtest/gtest.h>

#include <cmath>
#include <complex>
#include <vector>

namespace {

constexpr double kPi = 3.14159265358979323846;

// Zero-phase amplitude of a linear-phase filter at frequency f (cycles/sample).
std::complex<double> response(const std::vector<double>& h, double f) {
  std::complex<double> s = 0;
  for (std::size_t k = 0; k < h.size(); ++k) s += h[k] * std::polar(1.0, -2 * kPi * f * k);
  return s * std::polar(1.0, 2 * kPi * f * (h.size() - 1) / 2.0);
}

struct BandErrors {
  double pass = 0, stop = 0;
};

BandErrors measure(const std::vector<double>& h, double fp, double fs) {
  BandErrors e;
  for (int i = 0; i <= 20000; ++i) {
    const double f = 0.5 * i / 20000;
    const double a = response(h, f).real();
    if (f <= fp) e.pass = std::max(e.pass, std::fabs(a - 1.0));
    if (f >= fs) e.stop = std::max(e.stop, std::fabs(a));
  }
  return e;
}

TEST(Remez, LowPassMeetsTheRippleAndAttenuationItWasDesignedFor) {
  // Passband ripple 0.01, stopband 60 dB, transition 0.05 cycles/sample:
  // Kaiser's length estimate (-20 log10 sqrt(dp ds) - 13) / (14.6 df) + 1
  // gives 51.7; two taps of margin as usual for the estimate.
  const double dp = 0.01, ds = 0.001, fp = 0.15, fs = 0.20;
  const int n = 55;
  const double bands[4] = {0.0, fp, fs, 0.5}, des[2] = {1.0, 0.0}, wt[2] = {1.0, dp / ds};
  std::vector<double> h(n);
  ASSERT_EQ(remez_(h.data(), n, 2, bands, des, wt, REMEZ_BANDPASS), 0);
  for (int k = 0; k < n; ++k) EXPECT_NEAR(h[k], h[n - 1 - k], 1e-15);
  const BandErrors e = measure(h, fp, fs);
  EXPECT_LE(e.pass, dp);
  EXPECT_LE(e.stop, ds);
  EXPECT_LE(20 * std::log10(e.stop), -60.0);
  // Equiripple: weighted errors equal in both bands.
  EXPECT_NEAR(e.pass / (e.stop * wt[1]), 1.0, 0.01);
  // Response is exactly linear phase: imaginary part of the zero-phase response is zero.
  EXPECT_NEAR(response(h, 0.123).imag(), 0.0, 1e-12);
}

TEST(Remez, ComplexFormHasZeroImaginaryPartsAndBadBandsFail) {
  const int n = 31;
  const double bands[4] = {0.0, 0.1, 0.16, 0.5}, des[2] = {1.0, 0.0}, wt[2] = {1.0, 5.0};
  std::vector<fcomplex> h(n, fcomplex(7.0f, 7.0f));
  ASSERT_EQ(remez(h.data(), n, 2, bands, des, wt), 0);
  std::vector<double> ref(n);
  ASSERT_EQ(remez_(ref.data(), n, 2, bands, des, wt, REMEZ_BANDPASS), 0);
  for (int k = 0; k < n; ++k) {
    EXPECT_EQ(h[k].imag(), 0.0f);
    EXPECT_EQ(h[k].real(), static_cast<float>(ref[k]));
  }
  const double bad[4] = {0.0, 0.2, 0.1, 0.5};
  EXPECT_NE(remez(h.data(), n, 2, bad, des, wt), 0);
  const double beyond[4] = {0.0, 0.2, 0.3, 0.6};
  EXPECT_NE(remez(h.data(), n, 2, beyond, des, wt), 0);
}

// Spectrum (along the wavenumber axis) of a signal occupying the first 80 %
// of a 64-sample window, at continuous position k.
std::complex<double> spectrumAt(const std::vector<std::complex<double>>& x, double k) {
  std::complex<double> s = 0;
  const double N = 64.0;
  for (std::size_t t = 0; t < x.size(); ++t) s += x[t] * std::polar(1.0, -2 * kPi * t * k / N);
  return s;
}

TEST(MakeGLS, KernelTableInterpolatesSpectraOfLeadingSignals) {
  const int H = 6, n = 2 * H + 1, nfrac = 101;
  const double B = 0.8;
  std::vector<fcomplex> table(static_cast<std::size_t>(n) * nfrac);
  ASSERT_EQ(MakeGLS(table.data(), n, nfrac, B), 0);
  // Row 50 is the zero shift: a unit impulse at the centre tap.
  for (int m = 0; m < n; ++m) {
    EXPECT_NEAR(table[50 * n + m].real(), m == H ? 1.0f : 0.0f, 1e-5f);
    EXPECT_NEAR(table[50 * n + m].imag(), 0.0f, 1e-5f);
  }
  // A signal of 51 samples (80 % of the 64 window) with fixed pseudo-random values.
  std::vector<std::complex<double>> x(51);
  for (std::size_t t = 0; t < x.size(); ++t)
    x[t] = std::complex<double>(std::cos(1.7 * t * t + 0.3), std::sin(0.9 * t + 0.2 * t * t));
  double err2 = 0, sig2 = 0, truncErr2 = 0;
  for (int row = 0; row < nfrac; row += 7) {
    const double f = (row - 50) / 100.0;
    const fcomplex* k = &table[static_cast<std::size_t>(row) * n];
    for (int u = 20; u < 40; ++u) {
      std::complex<double> y = 0, yt = 0;
      for (int m = 0; m < n; ++m) {
        const std::complex<double> xm = spectrumAt(x, u - H + m);
        y += std::complex<double>(k[m].real(), k[m].imag()) * xm;
        // Plain truncated kernel of the same band for comparison.
        const double d = f - (m - H);
        const double sinc = d == 0 ? 1.0 : std::sin(kPi * B * d) / (kPi * B * d);
        yt += B * sinc * std::polar(1.0, -kPi * B * d) * xm;
      }
      const std::complex<double> truth = spectrumAt(x, u + f);
      err2 += std::norm(y - truth);
      truncErr2 += std::norm(yt - truth);
      sig2 += std::norm(truth);
    }
  }
  EXPECT_LT(std::sqrt(err2 / sig2), 0.02);
  EXPECT_LT(err2, truncErr2);  // least squares beats truncation
}

}  // namespace
