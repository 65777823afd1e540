// Point targets focused through the azimuth block driver with the Stolt
// kernels: chirp-z zoom (PerformInterpolation 1) and least-squares table
// (PerformInterpolation 7 with padding).
#include <gtest/gtest.h>

#include <cmath>
#include <complex>
#include <vector>

#include "azimuth_test_scene.h"
#include "core/azimuth_focus.h"

namespace {

using namespace azimuth_scene;

struct Focused {
  AzimuthFocusScene scene;
  std::vector<fcomplex> image;
  std::vector<Target> targets;
};

// Simulates and focuses in core; a first pass on an empty raster gives the
// output annotation that places the targets.
// `slopeHz`: the processing centroid moves by that much across the swath
// while the echoes keep g.dc (a centroid estimated with a range trend).
Focused focus(const Geometry& g, const AzimuthFocusConf& conf, double slopeHz = 0.0) {
  Focused f;
  AzimuthFocusFiles files;
  fillScene(g, files, f.scene);
  f.scene.polyDC[1] = slopeHz / (g.samples / g.frg);
  f.scene.inCore = 1;
  std::vector<fcomplex> probe(static_cast<std::size_t>(g.samples) * g.lines);
  f.scene.buffer = probe.data();
  EXPECT_EQ(azimuthfoc(files, f.scene, conf), 0);
  f.targets = placeTargets(g, f.scene.firstLineTime, f.scene.firstSampleTime);
  f.image = simulate(g, f.targets);
  f.scene.buffer = f.image.data();
  EXPECT_EQ(azimuthfoc(files, f.scene, conf), 0);
  f.image.resize(static_cast<std::size_t>(f.scene.outLines) * f.scene.outSamples);
  return f;
}

// Every target at its zero-Doppler pixel within 0.05, widths within 5% and
// PSLR / ISLR within 1 dB of the windows' impulse responses, peak phases
// -4 pi R0 / lambda up to one constant within 5 degrees.
void checkTargets(const Geometry& g, const AzimuthFocusConf& conf, bool rangeWindow,
                  const Focused& f) {
  const double pa = conf.AzimuthWindowHammingParameter;
  const double pr = rangeWindow ? conf.RangeWindowHammingParameter : 1.0;
  const double azlook = conf.AzimuthLookBandwidth, rglook = conf.RangeLookBandwidth;
  const Profile thAz = theoryProfile([&](double u) {
    const double fa = std::fabs(u * g.prf);
    if (fa >= azlook / 2.0) return 0.0;
    return (pa + (1.0 - pa) * std::cos(kPi * fa / (azlook / 2.0))) * g.pattern(g.dc + u * g.prf);
  });
  const Profile thRg = theoryProfile([&](double u) {
    const double fr = std::fabs(u * g.frg);
    if (fr > g.B / 2.0 || fr >= rglook / 2.0) return 0.0;
    return pr + (1.0 - pr) * std::cos(kPi * fr / (rglook / 2.0));
  });
  std::vector<double> residual;
  for (const Target& t : f.targets) {
    const double row = (t.t0 - f.scene.firstLineTime) * g.prf;
    const double col = (2.0 * t.R0 / kC - f.scene.firstSampleTime) * g.frg;
    const PointMeasure m = measure(f.image.data(), f.scene.outLines, f.scene.outSamples, row, col);
    SCOPED_TRACE(testing::Message() << "target at row " << row << " col " << col);
    EXPECT_NEAR(m.row, row, 0.05);
    EXPECT_NEAR(m.col, col, 0.05);
    EXPECT_NEAR(m.az.width / thAz.width, 1.0, 0.05);
    EXPECT_NEAR(m.rg.width / thRg.width, 1.0, 0.05);
    EXPECT_NEAR(m.az.pslr, thAz.pslr, 1.0);
    EXPECT_NEAR(m.rg.pslr, thRg.pslr, 1.0);
    EXPECT_NEAR(m.az.islr, thAz.islr, 1.0);
    EXPECT_NEAR(m.rg.islr, thRg.islr, 1.0);
    residual.push_back(m.phase + 4.0 * kPi * t.R0 / g.lambda());
  }
  std::complex<double> mean = 0.0;
  for (double r : residual) mean += std::polar(1.0, r);
  for (double r : residual)
    EXPECT_LT(std::fabs(std::arg(std::polar(1.0, r) / mean)) * 180.0 / kPi, 5.0);
}

TEST(StoltFocusPointTargets, LeastSquaresKernelErsLikeCentroid) {
  Geometry g;
  g.dc = 300.0;
  const AzimuthFocusConf conf = sceneConf(g, 7, 0.4);
  checkTargets(g, conf, true, focus(g, conf));
}

TEST(StoltFocusPointTargets, LeastSquaresKernelCentroidNearHalfPrf) {
  Geometry g;
  g.dc = 0.48 * g.prf;
  const AzimuthFocusConf conf = sceneConf(g, 7, 0.4);
  checkTargets(g, conf, true, focus(g, conf));
}

TEST(StoltFocusPointTargets, ChirpZoomKernelErsLikeCentroid) {
  Geometry g;
  g.dc = 300.0;
  const AzimuthFocusConf conf = sceneConf(g, 1, 0.4);
  checkTargets(g, conf, false, focus(g, conf));
}

TEST(StoltFocusPointTargets, ChirpZoomKernelCentroidNearHalfPrf) {
  Geometry g;
  g.dc = 0.48 * g.prf;
  const AzimuthFocusConf conf = sceneConf(g, 1, 0.4);
  checkTargets(g, conf, false, focus(g, conf));
}

// The peak phase is -4 pi R0 / lambda itself, whatever the centroid, its
// ambiguity, and a 150 Hz range trend of the processing centroid against
// the echoes'. (It used to carry a constant that moved with the centroid,
// from the azimuth shift turned against the centroid's wavenumber and the
// residual wavenumber offset of one reference for the whole block.)
TEST(StoltFocusPointTargets, PeakPhaseFreeOfTheCentroid) {
  struct Case {
    double dc, slope;
  };
  for (const Case c : {Case{0.0, 0.0}, Case{320.0, 150.0}, Case{-450.0, 0.0}, Case{2300.0, 0.0},
                       Case{2300.0, 150.0}}) {
    {
      const double dc = c.dc, slope = c.slope;
      Geometry g;
      g.dc = dc;
      const AzimuthFocusConf conf = sceneConf(g, 7, 0.4);
      const Focused f = focus(g, conf, slope);
      // The helper places the azimuth spectrum in the band of the wrapped
      // centroid; n whole PRFs above it the phase at a peak between lines
      // turns by 2 pi n times the line.
      const double n = std::round(dc / g.prf);
      for (const Target& t : f.targets) {
        const double row = (t.t0 - f.scene.firstLineTime) * g.prf;
        const double col = (2.0 * t.R0 / kC - f.scene.firstSampleTime) * g.frg;
        const PointMeasure m = measure(f.image.data(), f.scene.outLines, f.scene.outSamples, row, col);
        const double residual =
            std::remainder(m.phase + 2.0 * kPi * n * m.row + 4.0 * kPi * t.R0 / g.lambda(), 2.0 * kPi);
        EXPECT_LT(std::fabs(residual) * 180.0 / kPi, 5.0)
            << "centroid " << dc << " Hz, trend " << slope << " Hz, target at " << row << ", " << col;
      }
    }
  }
}

}  // namespace
