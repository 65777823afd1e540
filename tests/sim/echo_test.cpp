// Physics of the simulated echoes: a plain time-domain focuser (chirp
// correlation, then back-projection with the exact range history) puts a
// target where the truth says; clutter and target spectra sit at the
// Doppler centroid; rendering is deterministic.
#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <vector>

#ifdef _OPENMP
#include <omp.h>
#endif

#include "base/constants.h"
#include "sim/raw_scene.h"
#include "sim/sim_fft.h"

namespace {

constexpr double kC = 299792458.0;

SceneDescription smallScene() {
  SceneDescription s;
  s.mission = "ERS2";
  s.lines = 3200;
  s.samples = 1024;
  s.dopplerCentroidHz = 310.0;
  return s;
}

// Range compression: correlation with the replica exp(j pi K t^2) of
// n = round(fs T) samples centred on its middle; output m starts at the
// replica's first sample.
std::vector<cdouble> rangeCompress(const fcomplex* line, int samples, const RawSceneSimulator& sim) {
  const int n = sim.replicaLength();
  const double fs = sim.scene().samplingRateHz, K = sim.chirpRate();
  const int N = nextPowerOfTwo(samples + n);
  std::vector<cdouble> x(N), r(N);
  for (int j = 0; j < samples; ++j) x[j] = cdouble(line[j].real(), line[j].imag());
  for (int i = 0; i < n; ++i) {
    const double t = (i - (n - 1) * 0.5) / fs;
    r[i] = std::polar(1.0, M_PI * K * t * t);
  }
  simFft(x.data(), N, -1);
  simFft(r.data(), N, -1);
  for (int k = 0; k < N; ++k) x[k] *= std::conj(r[k]) / static_cast<double>(N);
  simFft(x.data(), N, +1);
  x.resize(samples - n + 1);
  return x;
}

cdouble interpolate(const std::vector<cdouble>& v, double x) {
  const int h = 16;
  const int i0 = static_cast<int>(std::floor(x));
  cdouble acc = 0.0;
  for (int i = i0 - h + 1; i <= i0 + h; ++i) {
    if (i < 0 || i >= static_cast<int>(v.size())) continue;
    const double d = x - i;
    const double s = d == 0.0 ? 1.0 : std::sin(M_PI * d) / (M_PI * d);
    const double w = 0.5 * (1.0 + std::cos(M_PI * d / (h + 0.5)));
    acc += v[i] * s * w;
  }
  return acc;
}

double parabolic(double a, double b, double c) { return 0.5 * (a - c) / (a - 2.0 * b + c); }

}  // namespace

TEST(SimEcho, TimeDomainFocuserPeaksAtTheTruthPosition) {
  // Place a target through a pixel position, then simulate it again from
  // its latitude and longitude alone: both truths must agree.
  SceneDescription a = smallScene();
  a.pixelTargets.push_back({1600.37, 300.61, 50.0, 1.0});
  const TargetTruth placed = RawSceneSimulator(a).truth()[0];
  EXPECT_NEAR(placed.line, 1600.37, 1e-4);
  EXPECT_NEAR(placed.sample, 300.61, 1e-4);

  SceneDescription s = smallScene();
  s.targets.push_back({placed.latDeg, placed.lonDeg, placed.height, 1.0});
  const RawSceneSimulator sim(s);
  const TargetTruth t = sim.truth()[0];
  EXPECT_NEAR(t.line, placed.line, 1e-4);
  EXPECT_NEAR(t.sample, placed.sample, 1e-4);
  ASSERT_GE(t.firstLine, 0);
  ASSERT_LT(t.lastLine, s.lines);
  EXPECT_GT(t.lastLine - t.firstLine, 1500);  // the synthetic aperture

  std::vector<fcomplex> raw;
  sim.renderLines(0, s.lines, raw);
  std::vector<std::vector<cdouble>> rc(s.lines);
  for (int k = t.firstLine; k <= t.lastLine; ++k) rc[k] = rangeCompress(raw.data() + static_cast<std::size_t>(k) * s.samples, s.samples, sim);

  // Back-projection onto the zero-Doppler grid of (line, sample).
  const double lambda = kC / sim.scene().carrierHz, fs = sim.scene().samplingRateHz, prf = sim.scene().prfHz;
  std::vector<StateVector> sv(s.lines);
  for (int k = t.firstLine; k <= t.lastLine; ++k) sv[k] = sim.orbit().at(s.startTime + k / prf);
  auto image = [&](double line, double sample) {
    const double tz = s.startTime + line / prf;
    const double R = kC / 2.0 * (sim.swst() + (sample - sim.rangePeakOffset()) / fs);
    double lat = 0, lon = 0;
    EXPECT_TRUE(zeroDopplerPoint(sim.orbit(), tz, R, t.height, 1, lat, lon));
    const Vec3 p = geodeticToEcef(lat, lon, t.height);
    cdouble acc = 0.0;
    for (int k = t.firstLine; k <= t.lastLine; ++k) {
      const double Rk = norm(sv[k].pos - p);
      const double x = (2.0 * Rk / kC - sim.swst()) * fs + sim.rangePeakOffset();
      acc += interpolate(rc[k], x) * std::polar(1.0, 4.0 * M_PI * Rk / lambda);
    }
    return std::abs(acc);
  };
  const double step = 0.1;
  const int h = 10;
  std::vector<double> grid((2 * h + 1) * (2 * h + 1));
  int bi = 0, bj = 0;
  for (int i = -h; i <= h; ++i)
    for (int j = -h; j <= h; ++j) {
      const double v = image(std::round(t.line) + i * step, std::round(t.sample) + j * step);
      grid[(i + h) * (2 * h + 1) + (j + h)] = v;
      if (v > grid[(bi + h) * (2 * h + 1) + (bj + h)]) {
        bi = i;
        bj = j;
      }
    }
  ASSERT_LT(std::abs(bi), h);
  ASSERT_LT(std::abs(bj), h);
  auto g = [&](int i, int j) { return grid[(i + h) * (2 * h + 1) + (j + h)]; };
  const double peakLine = std::round(t.line) + (bi + parabolic(g(bi - 1, bj), g(bi, bj), g(bi + 1, bj))) * step;
  const double peakSample = std::round(t.sample) + (bj + parabolic(g(bi, bj - 1), g(bi, bj), g(bi, bj + 1))) * step;
  std::printf("time-domain focuser: peak offset %.4f lines, %.4f samples\n", peakLine - t.line, peakSample - t.sample);
  EXPECT_NEAR(peakLine, t.line, 0.05);
  EXPECT_NEAR(peakSample, t.sample, 0.05);
}

TEST(SimEcho, RenderingIsIndependentOfBlocksAndThreads) {
  SceneDescription s = smallScene();
  s.lines = 3000;
  s.samples = 900;
  s.clutterSigma = 2.0;
  s.noiseSigma = 1.0;
  s.pixelTargets.push_back({1400.0, 80.0, 0.0, 3.0});
  s.pixelTargets.push_back({1500.0, 120.0, 0.0, 2.0});
  const RawSceneSimulator sim(s);
  std::vector<fcomplex> whole, part1, part2;
  sim.renderLines(1200, 96, whole);
  sim.renderLines(1200, 37, part1);
  sim.renderLines(1237, 59, part2);
  part1.insert(part1.end(), part2.begin(), part2.end());
  ASSERT_EQ(whole.size(), part1.size());
  EXPECT_EQ(0, std::memcmp(whole.data(), part1.data(), whole.size() * sizeof(fcomplex)));
#ifdef _OPENMP
  const int threads = omp_get_max_threads();
  omp_set_num_threads(1);
  std::vector<fcomplex> serial;
  sim.renderLines(1200, 96, serial);
  omp_set_num_threads(std::max(2, threads));
  EXPECT_EQ(0, std::memcmp(whole.data(), serial.data(), whole.size() * sizeof(fcomplex)));
  omp_set_num_threads(threads);
#endif
}

TEST(SimGeometry, OrbitTimeAndGeodesyAreConsistent) {
  // Calendar.
  double t = 0.0;
  ASSERT_TRUE(simParseDate("17-FEB-2000 09:57:26.417", t));
  EXPECT_EQ(simDateText(t), "17-FEB-2000 09:57:26.417");
  EXPECT_EQ(simCompactDateText(t), "20000217095726417");
  EXPECT_DOUBLE_EQ(simSec85({2000, 1, 1, 0, 0, 0.0}), 5478.0 * 86400.0);
  EXPECT_EQ(simDayOfYear(2000, 2, 17), 48);
  EXPECT_FALSE(simParseDate("17-FOO-2000 09:57:26", t));
  // Orbit: velocity is the derivative of position; Earth-fixed speed and
  // radius stay in the ERS range.
  const SimOrbit orbit(KeplerElements{});
  const StateVector a = orbit.at(100.0), b = orbit.at(100.001), c = orbit.at(99.999);
  for (int k = 0; k < 3; ++k) EXPECT_NEAR((b.pos[k] - c.pos[k]) / 0.002, a.vel[k], 1e-4);
  EXPECT_NEAR(norm(a.pos), 7.16e6, 2e4);
  EXPECT_NEAR(norm(a.vel), 7.55e3, 1e2);
  // Inertial energy is conserved over half an orbit.
  auto energy = [](const StateVector& s) {
    const Vec3 vi{s.vel[0] - 7.292115189334571e-5 * s.pos[1], s.vel[1] + 7.292115189334571e-5 * s.pos[0], s.vel[2]};
    return 0.5 * dot(vi, vi) - 3.986004418e14 / norm(s.pos);
  };
  EXPECT_NEAR(energy(orbit.at(0.0)), energy(orbit.at(3000.0)), 1e-3);
  // Geodesy round trips.
  double lat = 0, lon = 0, hh = 0;
  ecefToGeodetic(geodeticToEcef(41.851, 12.03, 785000.0), lat, lon, hh);
  EXPECT_NEAR(lat, 41.851, 1e-10);
  EXPECT_NEAR(lon, 12.03, 1e-10);
  EXPECT_NEAR(hh, 785000.0, 1e-5);
  const Vec3 p = a.pos;
  ecefToDeos(p, lat, lon, hh);
  const Vec3 q = deosToEcef(lat, lon, hh);
  EXPECT_NEAR(norm(p - q), 0.0, 1e-5);
  // Closest approach: the range rate vanishes there.
  const Vec3 target = geodeticToEcef(45.0, 10.0, 0.0);
  const double tc = closestApproachTime(orbit, target, 0.0);
  const StateVector sc = orbit.at(tc);
  EXPECT_NEAR(dot(sc.pos - target, sc.vel) / norm(sc.pos - target), 0.0, 1e-6);
}

TEST(SimEcho, SamplingWindowChangeMovesTheEchoInTheWindow) {
  SceneDescription s = smallScene();
  s.dopplerCentroidHz = 0.0;
  s.swstChangeLine = 1601;
  s.swstChangeCodes = 20;  // 80 samples later
  s.pixelTargets.push_back({1600.0, 200.0, 0.0, 1.0});
  const RawSceneSimulator sim(s);
  EXPECT_EQ(sim.swstCodeOf(1600), sim.swstCode());
  EXPECT_EQ(sim.swstCodeOf(1601), sim.swstCode() + 20);
  std::vector<fcomplex> raw;
  sim.renderLines(1600, 2, raw);
  auto peak = [&](int row) {
    const std::vector<cdouble> rc = rangeCompress(raw.data() + static_cast<std::size_t>(row) * s.samples, s.samples, sim);
    int m = 0;
    for (int k = 0; k < static_cast<int>(rc.size()); ++k)
      if (std::abs(rc[k]) > std::abs(rc[m])) m = k;
    return m;
  };
  EXPECT_NEAR(peak(0) - peak(1), 80, 1);
}
