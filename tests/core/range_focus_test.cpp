#include "core/range_focus.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <numbers>
#include <string>
#include <vector>

#include "base/status.h"
#include "core/fft.h"
#include "support/files.h"
#include "support/scenes.h"

namespace {

using namespace support::raw;

class RangeFocTest : public ::testing::Test {
 protected:
  std::string path(const std::string& name) const { return dir_ / name; }
  support::TempFolder dir_{"rangefoc"};
};

void checkFocused(const Scene& sc, const std::vector<fcomplex>& out, int O) {
  const int n = sc.pulse.n();
  const int V = sc.samples - n + 1;
  ASSERT_EQ(out.size(), static_cast<std::size_t>(O) * sc.lines);
  for (int l = 0; l < sc.lines; ++l) {
    const fcomplex* row = &out[static_cast<std::size_t>(l) * O];
    const int s = sc.shifts[l];
    for (int k = 0; k < s; ++k) ASSERT_EQ(row[k], fcomplex(0, 0)) << l;
    for (int k = s + V; k < O; ++k) ASSERT_EQ(row[k], fcomplex(0, 0)) << l;
    for (const auto& g : sc.targets) {
      // The peak lies at the expected sample, whatever the line's SWST, with
      // the amplitude a * n of a lossless correlation and zero phase.
      int best = g.peak - 5;
      for (int k = g.peak - 5; k <= g.peak + 5; ++k)
        if (std::abs(row[k]) > std::abs(row[best])) best = k;
      EXPECT_EQ(best, g.peak) << "line " << l;
      const double a0 = std::abs(row[g.peak - 1]), a1 = std::abs(row[g.peak]),
                   a2 = std::abs(row[g.peak + 1]);
      const double frac = 0.5 * (a0 - a2) / (a0 - 2 * a1 + a2);
      EXPECT_NEAR(frac, 0.0, 0.02) << "line " << l;
      EXPECT_NEAR(a1, g.amplitude * n, 1e-3 * g.amplitude * n) << "line " << l;
      EXPECT_NEAR(std::arg(row[g.peak]), 0.0, 1e-3);
    }
  }
}

TEST_F(RangeFocTest, PointEchoesFocusAtTheirSamplesAlignedToSwstMin) {
  const Scene sc = makeScene();
  sc.write(path("raw"));
  const auto replica = sc.pulse.replica();
  for (int perBlock : {8, 7, 1000}) {  // exact division, remainder, one pass
    RangeFocWork w;
    w.replica = replica.data();
    w.replicaLen = static_cast<int>(replica.size());
    w.linesPerBlock = perBlock;
    const auto p = sc.params(path("raw"), path("rgfoc"));
    ASSERT_EQ(rangefoc(p, w), 0);
    const int V = sc.samples - sc.pulse.n() + 1;
    EXPECT_EQ(w.outSamples, V + sc.maxShift);
    EXPECT_EQ(w.outLines, sc.lines);
    checkFocused(sc, support::readComplex(path("rgfoc")), w.outSamples);
  }

  // Against a direct correlation of one shifted line.
  RangeFocWork w;
  w.replica = replica.data();
  w.replicaLen = static_cast<int>(replica.size());
  ASSERT_EQ(rangefoc(sc.params(path("raw"), path("rgfoc")), w), 0);
  const auto out = support::readComplex(path("rgfoc"));
  const int l = 25, O = w.outSamples;
  const auto x = sc.line(l);
  for (int k : {0, 1, 150, 700, 1344}) {
    dcomplex s = 0.0;
    for (int m = 0; m < w.replicaLen; ++m) s += dcomplex(x[k + m]) * std::conj(dcomplex(replica[m]));
    EXPECT_LT(std::abs(dcomplex(out[l * O + sc.shifts[l] + k]) - s), 2e-3 + 1e-4 * std::abs(s)) << k;
  }
}

TEST_F(RangeFocTest, InCoreMatchesTheFilePath) {
  const Scene sc = makeScene();
  sc.write(path("raw"));
  sc.write(path("raw_samples"), true);
  const auto replica = sc.pulse.replica();
  RangeFocWork wf;
  wf.replica = replica.data();
  wf.replicaLen = static_cast<int>(replica.size());
  ASSERT_EQ(rangefoc(sc.params(path("raw"), path("file_out")), wf), 0);

  RangeFocWork wc;
  wc.replica = replica.data();
  wc.replicaLen = static_cast<int>(replica.size());
  wc.incore = 1;
  const auto p = sc.params(path("raw_samples"), path("core_out"));
  ASSERT_EQ(init_buffer(p, wc), 0);
  EXPECT_EQ(wc.shift, sc.shifts);
  ASSERT_EQ(rangefoc(p, wc), 0);
  ASSERT_EQ(dest_buffer(p, wc), 0);
  EXPECT_TRUE(wc.data.empty());
  const auto a = support::readComplex(path("file_out")), b = support::readComplex(path("core_out"));
  ASSERT_EQ(a.size(), b.size());
  for (std::size_t i = 0; i < a.size(); ++i) ASSERT_LT(std::abs(a[i] - b[i]), 1e-3f) << i;
}

TEST_F(RangeFocTest, FailuresAndLimits) {
  Scene sc = makeScene();
  sc.lines = 4;
  sc.write(path("raw"));
  auto replica = sc.pulse.replica();
  RangeFocWork w;
  w.replica = replica.data();
  w.replicaLen = static_cast<int>(replica.size());

  // Missing input.
  EXPECT_EQ(rangefoc(sc.params(path("nothing"), path("out")), w), 9);
  // Truncated input.
  {
    auto p = sc.params(path("raw"), path("out"));
    p.lines = 5;
    EXPECT_EQ(rangefoc(p, w), 4);
  }
  // A line whose SWST lies beyond SWST_MAX.
  {
    auto p = sc.params(path("raw"), path("out"));
    p.swstMax = p.swstMin + 5 / sc.pulse.fs;
    EXPECT_EQ(rangefoc(p, w), 1);
  }
  // A replica as long as the line gives one valid sample; longer fails.
  {
    Scene small = sc;
    small.samples = sc.pulse.n();
    small.targets = {};
    small.write(path("small"));
    RangeFocWork ws = w;
    ASSERT_EQ(rangefoc(small.params(path("small"), path("out")), ws), 0);
    EXPECT_EQ(ws.outSamples, 1 + small.maxShift);
    small.samples = sc.pulse.n() - 1;
    EXPECT_EQ(rangefoc(small.params(path("small"), path("out")), ws), 1);
  }
  // A device that takes nothing: write failure, whatever the pass.
  if (std::filesystem::exists("/dev/full")) {
    for (int perBlock : {1, 8, 1000}) {
      w.linesPerBlock = perBlock;
      EXPECT_EQ(rangefoc(sc.params(path("raw"), "/dev/full"), w), STATUS_WRITE_FAILED) << perBlock;
    }
  }
}

TEST(RangeCompressor, ChunkedCorrelationEqualsOneShotTransforms) {
  const int N = 640, rows = 300;  // several chunks and a remainder
  std::vector<fcomplex> rep(100);
  for (int i = 0; i < 100; ++i) rep[i] = fcomplex(std::cos(0.01f * i * i), std::sin(0.02f * i));
  RangeCompressor rc;
  ASSERT_EQ(rc.init(rep.data(), 100, N), 0);
  EXPECT_EQ(rc.fftLength(), N);
  FFTBuffer a(static_cast<std::size_t>(N) * rows);
  for (std::size_t i = 0; i < a.size(); ++i)
    a[i] = fcomplex(std::sin(0.37f * (i % 997)), std::cos(0.11f * (i % 613)));
  FFTBuffer b = a;
  rc.compress(a.data(), rows);
  std::vector<fcomplex> spec(N);
  std::copy(rep.begin(), rep.end(), spec.begin());
  fft_c(N, N, 1, 1, FFT_FORWARD, FFT_NONE, spec.data(), spec.data());
  fft_c(N, N, rows, rows, FFT_FORWARD, FFT_NONE, b.data(), b.data());
  for (int r = 0; r < rows; ++r)
    for (int k = 0; k < N; ++k) b[r * N + k] *= std::conj(spec[k]);
  fft_c(N, N, rows, rows, FFT_BACKWARD_NORMALISED, FFT_NONE, b.data(), b.data());
  for (std::size_t i = 0; i < a.size(); ++i) ASSERT_LT(std::abs(a[i] - b[i]), 1e-4f) << i;
  EXPECT_EQ(range_max_shift(1e-3, 1e-3 + 10.4 / 18.96e6, 18.96e6), 10);
  EXPECT_EQ(range_max_shift(1e-3, 1e-3 + 10.6 / 18.96e6, 18.96e6), 11);
}

}  // namespace
