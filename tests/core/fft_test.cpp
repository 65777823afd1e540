#include "core/fft.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <numbers>
#include <random>
#include <thread>
#include <vector>

namespace {

std::vector<fcomplex> randomSignal(std::size_t n, unsigned seed) {
  std::mt19937 gen(seed);
  std::uniform_real_distribution<float> u(-1.0f, 1.0f);
  std::vector<fcomplex> v(n);
  for (auto& x : v) x = fcomplex(u(gen), u(gen));
  return v;
}

// Direct DFT in double: sign -1 forward, +1 backward (unscaled).
std::vector<dcomplex> dft(const fcomplex* x, int n, int stride, int sign) {
  std::vector<dcomplex> out(n);
  for (int k = 0; k < n; ++k) {
    dcomplex s = 0.0;
    for (int m = 0; m < n; ++m) {
      double p = sign * 2.0 * std::numbers::pi * static_cast<double>(m) * k / n;
      s += dcomplex(x[static_cast<std::size_t>(m) * stride]) * std::polar(1.0, p);
    }
    out[k] = s;
  }
  return out;
}

double maxAbs(const std::vector<dcomplex>& v) {
  double m = 0.0;
  for (auto& x : v) m = std::max(m, std::abs(x));
  return m;
}

TEST(Genpow, SmoothLengthsAndTheExcludedValue) {
  EXPECT_EQ(genpow(0, 1), 0);
  EXPECT_EQ(genpow(-5, 1), 0);
  EXPECT_EQ(genpow(1, 1), 1);
  EXPECT_EQ(genpow(7, 1), 8);
  EXPECT_EQ(genpow(97, 1), 100);
  EXPECT_EQ(genpow(8192, 1), 8192);
  EXPECT_EQ(genpow(8193, 1), 8640);
  EXPECT_EQ(genpow(5616, 1), 5760);  // 5625 is skipped
  EXPECT_EQ(genpow(5625, 1), 5760);
  EXPECT_EQ(genpow(5600, 1), 5760);
  EXPECT_EQ(genpow(5626, 1), 5760);
  EXPECT_EQ(genpow(5624, 1), 5760);
}

TEST(FftShift, EvenAndOddRows) {
  std::vector<fcomplex> even{0, 1, 2, 3, 4, 5, 10, 11, 12, 13, 14, 15};
  fftshift(even.data(), 6, 2);
  std::vector<fcomplex> evenWant{3, 4, 5, 0, 1, 2, 13, 14, 15, 10, 11, 12};
  EXPECT_EQ(even, evenWant);

  // a b c d e -> d e a b c
  std::vector<fcomplex> odd{0, 1, 2, 3, 4, 10, 11, 12, 13, 14};
  fftshift(odd.data(), 5, 2);
  EXPECT_EQ(odd, (std::vector<fcomplex>{3, 4, 0, 1, 2, 13, 14, 10, 11, 12}));

  std::vector<fcomplex> one{7};
  fftshift(one.data(), 1, 1);
  EXPECT_EQ(one[0], fcomplex(7));
}

TEST(FftPlan, DirectionCodesAndNormalisation) {
  const int n = 30;
  auto x = randomSignal(n, 1);
  std::vector<fcomplex> y(n);
  ASSERT_EQ(fft_c(n, n, 1, 1, FFT_FORWARD, FFT_NONE, x.data(), y.data()), 0);
  auto want = dft(x.data(), n, 1, -1);
  for (int k = 0; k < n; ++k) EXPECT_LT(std::abs(dcomplex(y[k]) - want[k]), 1e-5 * maxAbs(want));
  // Input kept by the out-of-place transform.
  EXPECT_EQ(x, randomSignal(n, 1));

  // -2: backward unscaled; -1: backward divided by N.
  std::vector<fcomplex> b2(n), b1(n);
  ASSERT_EQ(fft_c(n, n, 1, 1, FFT_BACKWARD, FFT_NONE, y.data(), b2.data()), 0);
  ASSERT_EQ(fft_c(n, n, 1, 1, FFT_BACKWARD_NORMALISED, FFT_NONE, y.data(), b1.data()), 0);
  auto back = dft(y.data(), n, 1, +1);
  for (int k = 0; k < n; ++k) {
    EXPECT_LT(std::abs(dcomplex(b2[k]) - back[k]), 1e-5 * maxAbs(back));
    EXPECT_LT(std::abs(b1[k] - x[k]), 1e-5f);
  }

  // In place gives the same.
  std::vector<fcomplex> z = x;
  ASSERT_EQ(fft_c(n, n, 1, 1, FFT_FORWARD, FFT_NONE, z.data(), z.data()), 0);
  for (int k = 0; k < n; ++k) EXPECT_LT(std::abs(z[k] - y[k]), 1e-5f);

  // A plan of a length-1 axis has no handle and never scales.
  FFTPlan p;
  ASSERT_EQ(fft_makep_c(p, 4, 1, 1, 1, FFT_BACKWARD_NORMALISED, FFT_NONE, 1), 0);
  EXPECT_EQ(p.row, nullptr);
  EXPECT_EQ(p.rowNormalise, 0);
  std::vector<fcomplex> v{fcomplex(3, 4), fcomplex(5, 6), 7, 8};
  pfft_c(p, v.data(), v.data());
  EXPECT_EQ(v, (std::vector<fcomplex>{fcomplex(3, 4), fcomplex(5, 6), 7, 8}));

  // -2 is stored as -1 with the flag clear.
  ASSERT_EQ(fft_makep_c(p, 8, 8, 1, 1, FFT_BACKWARD, FFT_NONE, 0), 0);
  EXPECT_EQ(p.rowDirection, -1);
  EXPECT_EQ(p.rowNormalise, 0);
  ASSERT_EQ(fft_makep_c(p, 8, 8, 1, 1, FFT_BACKWARD_NORMALISED, FFT_NONE, 0), 0);
  EXPECT_EQ(p.rowNormalise, 1);

  // Directions 0, 0 copy nothing.
  std::vector<fcomplex> out(4, fcomplex(-1, -1));
  ASSERT_EQ(fft_c(4, 4, 1, 1, FFT_NONE, FFT_NONE, v.data(), out.data()), 0);
  EXPECT_EQ(out, std::vector<fcomplex>(4, fcomplex(-1, -1)));
}

TEST(FftPlan, SubRectangleLeavesTheRestUntouched) {
  const int nx = 9, ux = 5, ny = 6, uy = 4;
  auto a = randomSignal(nx * ny, 2);
  auto orig = a;
  ASSERT_EQ(fft_c(nx, ux, ny, uy, FFT_BACKWARD_NORMALISED, FFT_NONE, a.data(), a.data()), 0);
  for (int y = 0; y < ny; ++y) {
    for (int x = 0; x < nx; ++x) {
      if (x < ux && y < uy) continue;
      EXPECT_EQ(a[y * nx + x], orig[y * nx + x]) << x << "," << y;
    }
  }
  for (int y = 0; y < uy; ++y) {
    auto want = dft(&orig[y * nx], ux, 1, +1);
    for (int x = 0; x < ux; ++x)
      EXPECT_LT(std::abs(dcomplex(a[y * nx + x]) - want[x] / double(ux)), 1e-5);
  }

  // Columns only, out of place: reads the input columns, scales by 1/uy.
  std::vector<fcomplex> out(nx * ny, fcomplex(9, 9));
  ASSERT_EQ(fft_c(nx, ux, ny, uy, FFT_NONE, FFT_BACKWARD_NORMALISED, orig.data(), out.data()), 0);
  for (int x = 0; x < ux; ++x) {
    auto want = dft(&orig[x], uy, nx, +1);
    for (int y = 0; y < uy; ++y)
      EXPECT_LT(std::abs(dcomplex(out[y * nx + x]) - want[y] / double(uy)), 1e-5);
  }
  EXPECT_EQ(out[ux], fcomplex(9, 9));
  EXPECT_EQ(out[uy * nx], fcomplex(9, 9));
}

TEST(FftPlan, ReusedPlanOnUnalignedAndSwappedPlacement) {
  const int n = 64, rows = 3;
  FFTPlan p;
  ASSERT_EQ(fft_makep_c(p, n, n, rows, rows, FFT_FORWARD, FFT_NONE, 0), 0);
  auto x = randomSignal(n * rows + 1, 4);
  std::vector<fcomplex> ref(n * rows), got(n * rows + 1);
  pfft_c(p, x.data(), ref.data());
  // Input and output shifted by one sample (8 bytes off the SIMD alignment).
  pfft_c(p, x.data() + 1, got.data() + 1);
  auto want = dft(x.data() + 1, n, 1, -1);
  for (int k = 0; k < n; ++k) EXPECT_LT(std::abs(dcomplex(got[k + 1]) - want[k]), 1e-4);
  // An out-of-place plan run in place.
  std::vector<fcomplex> inplace(x.begin(), x.begin() + n * rows);
  pfft_c(p, inplace.data(), inplace.data());
  for (int i = 0; i < n * rows; ++i) EXPECT_LT(std::abs(inplace[i] - ref[i]), 1e-5f);
  fft_destp_c(p);
}

TEST(FftPlan, ThreadCountDoesNotChangeResults) {
  const int n = 1024, rows = 64;
  auto x = randomSignal(n * rows, 5);
  std::vector<fcomplex> one(n * rows), two(n * rows);
  fft_set_threads(1);
  ASSERT_EQ(fft_c(n, n, rows, rows, FFT_FORWARD, FFT_NONE, x.data(), one.data()), 0);
  fft_set_threads(2);
  ASSERT_EQ(fft_c(n, n, rows, rows, FFT_FORWARD, FFT_NONE, x.data(), two.data()), 0);
  fft_set_threads(0);
  for (int i = 0; i < n * rows; ++i) ASSERT_LT(std::abs(one[i] - two[i]), 1e-3f);
  EXPECT_GE(fft_get_threads(), 1);
}

TEST(FftPlan, ConcurrentCallersShareTheCache) {
  // Several threads make and run plans of the same and of new shapes at once.
  std::vector<int> bad(4, 0);
  std::vector<std::thread> workers;
  for (int t = 0; t < 4; ++t) {
    workers.emplace_back([t, &bad] {
      for (int rep = 0; rep < 20; ++rep) {
        const int n = 40 + 3 * ((rep + t) % 7);
        auto x = randomSignal(n + 1, 100 + rep);
        std::vector<fcomplex> y(n + 1), z(n + 1);
        // Odd offset: the unaligned variant is made on demand.
        if (fft_c(n, n, 1, 1, FFT_FORWARD, FFT_NONE, x.data() + (rep % 2), y.data() + (rep % 2)) ||
            fft_c(n, n, 1, 1, FFT_BACKWARD_NORMALISED, FFT_NONE, y.data() + (rep % 2),
                  z.data() + (rep % 2)))
          ++bad[t];
        for (int k = 0; k < n; ++k)
          if (std::abs(z[k + rep % 2] - x[k + rep % 2]) > 1e-5f) ++bad[t];
      }
    });
  }
  for (auto& w : workers) w.join();
  EXPECT_EQ(bad, std::vector<int>(4, 0));
}

TEST(ChirpZ, ZoomedGridMatchesTheDefiningSum) {
  const int M = 50, K = 23;
  const double a = -0.013, b = 0.4;
  auto x = randomSignal(M, 9);
  std::vector<fcomplex> X(K);
  CZTPlan plan;
  ASSERT_EQ(czt_makep_c(plan, M, K), 0);
  EXPECT_EQ(plan.L, genpow(M + K - 1, 1));
  ASSERT_EQ(pczt_c(plan, x.data(), X.data(), a, b, 1), 0);
  czt_destp_c(plan);
  for (int k = 0; k < K; ++k) {
    dcomplex s = 0.0;
    for (int n = 0; n < M; ++n) s += dcomplex(x[n]) * std::polar(1.0, n * (a * k - b));
    EXPECT_LT(std::abs(dcomplex(X[k]) - s), 1e-4 * std::max(1.0, std::abs(s))) << k;
  }
}

}  // namespace
