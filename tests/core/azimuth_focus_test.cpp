#include "core/azimuth_focus.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "azimuth_test_scene.h"
#include "core/azimuth_block.h"

#ifdef _OPENMP
#include <omp.h>
#endif

namespace {

using namespace azimuth_scene;

struct Focused {
  AzimuthFocusScene scene;
  std::vector<fcomplex> image;
  std::vector<Target> targets;
};

// Simulates and focuses in core. The target times come from a first pass on
// an empty raster that gives the output annotation.
Focused focusScene(const Geometry& g, const AzimuthFocusConf& conf) {
  Focused f;
  AzimuthFocusFiles files;
  fillScene(g, files, f.scene);
  // The annotation does not depend on the data nor, with the automatic
  // shifts, on the number of lines: a short empty raster gives it.
  {
    AzimuthFocusScene probeScene = f.scene;
    AzimuthFocusConf probeConf = conf;
    probeScene.lines = 1500;
    probeConf.ApplyAzShift = probeScene.lines;
    std::vector<fcomplex> probe(static_cast<std::size_t>(g.samples) * probeScene.lines);
    probeScene.inCore = 1;
    probeScene.buffer = probe.data();
    EXPECT_EQ(azimuthfoc(files, probeScene, probeConf), 0);
    EXPECT_EQ(probeScene.outLines, 100);
    f.targets = placeTargets(g, probeScene.firstLineTime, probeScene.firstSampleTime);
  }
  f.scene.inCore = 1;
  f.image = simulate(g, f.targets);
  f.scene.buffer = f.image.data();
  EXPECT_EQ(azimuthfoc(files, f.scene, conf), 0);
  f.image.resize(static_cast<std::size_t>(f.scene.outLines) * f.scene.outSamples);
  return f;
}

void checkTargets(const Geometry& g, const AzimuthFocusConf& conf, const Focused& f) {
  const double lam = g.lambda();
  // The chirp-z kernel leaves the range window out.
  const double pa = conf.AzimuthWindowHammingParameter;
  const double pr = conf.PerformInterpolation == 1 ? 1.0 : conf.RangeWindowHammingParameter;
  const double azlook = conf.AzimuthLookBandwidth, rglook = conf.RangeLookBandwidth;
  const Profile thAz = theoryProfile([&](double u) {
    const double f = std::fabs(u * g.prf);
    if (f >= azlook / 2.0) return 0.0;
    return (pa + (1.0 - pa) * std::cos(kPi * f / (azlook / 2.0))) * g.pattern(g.dc + u * g.prf);
  });
  const Profile thRg = theoryProfile([&](double u) {
    const double f = std::fabs(u * g.frg);
    if (f > g.B / 2.0 || f >= rglook / 2.0) return 0.0;
    return pr + (1.0 - pr) * std::cos(kPi * f / (rglook / 2.0));
  });
  std::vector<double> residual, amplitude;
  for (const Target& t : f.targets) {
    const double row = (t.t0 - f.scene.firstLineTime) * g.prf;
    const double col = (2.0 * t.R0 / kC - f.scene.firstSampleTime) * g.frg;
    const PointMeasure m =
        measure(f.image.data(), f.scene.outLines, f.scene.outSamples, row, col);
    SCOPED_TRACE(testing::Message() << "target at row " << row << " col " << col);
    EXPECT_NEAR(m.row, row, 0.05);
    EXPECT_NEAR(m.col, col, 0.05);
    EXPECT_NEAR(m.az.width / thAz.width, 1.0, 0.05);
    EXPECT_NEAR(m.rg.width / thRg.width, 1.0, 0.05);
    EXPECT_NEAR(m.az.pslr, thAz.pslr, 1.0);
    EXPECT_NEAR(m.rg.pslr, thRg.pslr, 1.0);
    EXPECT_NEAR(m.az.islr, thAz.islr, 1.0);
    EXPECT_NEAR(m.rg.islr, thRg.islr, 1.0);
    residual.push_back(m.phase + 4.0 * kPi * t.R0 / lam);
    amplitude.push_back(m.amplitude);
  }
  // Equal targets come out equally bright in every block and sub-block.
  const auto [lo, hi] = std::minmax_element(amplitude.begin(), amplitude.end());
  EXPECT_LT(*hi / *lo, 1.02);
  // Peak phases agree with -4 pi R0 / lambda up to one constant.
  std::complex<double> mean = 0.0;
  for (double r : residual) mean += std::polar(1.0, r);
  for (double r : residual) {
    const double d = std::arg(std::polar(1.0, r) / mean) * 180.0 / kPi;
    EXPECT_LT(std::fabs(d), 5.0);
  }
}

TEST(AzimuthFocusPointTargets, ErsLikeCentroidFocusesAtZeroDoppler) {
  Geometry g;
  g.dc = 300.0;
  const AzimuthFocusConf conf = sceneConf(g);
  const Focused f = focusScene(g, conf);
  EXPECT_EQ(f.scene.outSamples, g.samples - 64);
  EXPECT_EQ(f.scene.outLines, g.lines - 1400);
  EXPECT_NEAR(f.scene.Veq, g.V, 0.05);
  EXPECT_DOUBLE_EQ(f.scene.azSpacing, f.scene.Veq / g.prf);
  EXPECT_DOUBLE_EQ(f.scene.rgSpacing, 149896229.0 / g.frg);
  EXPECT_DOUBLE_EQ(f.scene.centroid, 300.0);
  checkTargets(g, conf, f);
}

void focusWithStolt(int interp) {
  Geometry g;
  g.dc = 300.0;
  AzimuthFocusConf conf = sceneConf(g);
  conf.PerformInterpolation = interp;
  conf.StoltPadding = 0.4;
  const Focused f = focusScene(g, conf);
  checkTargets(g, conf, f);
}

// Stolt kernels: the running range shift keeps the sub-blocks on one grid.
TEST(AzimuthFocusPointTargets, LeastSquaresStoltThroughTheDriver) { focusWithStolt(7); }

TEST(HeavyAzimuthFocusPointTargets, ChirpZStoltThroughTheDriver) { focusWithStolt(1); }

TEST(AzimuthFocusPointTargets, CentroidNearHalfPrfFocusesAtZeroDoppler) {
  Geometry g;
  g.dc = 0.48 * g.prf;
  const AzimuthFocusConf conf = sceneConf(g);
  const Focused f = focusScene(g, conf);
  checkTargets(g, conf, f);
}

}  // namespace
