// The RADARSAT-1 extractor on simulated CEOS products: the raster, window
// vector, gain compensation, replica, missing lines and the damaged files.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "ingest/radarsat/radarextract.h"
#include "orbit/general_sar_orbit.h"
#include "sim/radarsat_ceos_writer.h"
#include "support/files.h"
#include "support/scenes.h"

namespace {

namespace fs = std::filesystem;

std::vector<float> floats(const std::string& path) { return support::readValues<float>(path); }

class RadarsatSceneTest : public support::WorkingFolderTest {
 protected:
  // A small scene of a beam: one target, light clutter.
  SceneDescription scene(int lines) const {
    SceneDescription s = support::ersScene(lines, 1800, 0.0);
    s.nearRangeTime = 0.00655;  // 8 pulses in flight at 1300 Hz, then 0.4 ms
    s.prfHz = 1300.0;
    s.sceneDir = "RSAT_SIM";
    s.clutterSigma = 0.7;
    s.noiseSigma = 0.5;
    s.pixelTargets = {{lines / 2.0, 900.0, 0.0, 3.0}};
    return s;
  }
  std::unique_ptr<RadarsatSceneWriter> write(const SceneDescription& s, const RadarsatOptions& o) {
    auto w = std::make_unique<RadarsatSceneWriter>(s, o);
    std::string error;
    EXPECT_EQ(w->write(path("sim"), error), 0) << error;
    return w;
  }
  void aim(radarextract& x, const RadarsatSceneWriter& w) const {
    x.LeaderFile = w.leaderPath(path("sim"));
    x.DataFile = w.dataPath(path("sim"));
    x.OrbitFile = x.LeaderFile;
    x.OutputRawFile = path("scene.extracted");
    x.OutputChirpFile = path("scene.chirp");
  }
};

}  // namespace

TEST_F(RadarsatSceneTest, FineBeamWithWindowGainChangesReplicaAndMissingLine) {
  RadarsatOptions o;
  o.beam = "F2";
  o.rateCode = 0;
  o.waveform = 0;
  o.replicaEvery = 100;
  o.windowChangeLine = 150;
  o.windowChangeCodes = 3;
  o.gainChangeLine = 200;
  o.gainChangeDb = 6;
  o.dropLines = {120};
  const auto w = write(scene(300), o);
  const RawSceneSimulator& sim = w->simulator();
  radarextract x;
  aim(x, *w);
  ASSERT_EQ(x.run(), 0);

  const int samples = sim.scene().samples;
  const std::size_t row = 1 + 2 * std::size_t(samples);
  const std::vector<float> raster = floats(path("scene.extracted"));
  ASSERT_EQ(raster.size(), row * 300);
  // Window start of every line as the simulator placed its echoes.
  for (int k : {0, 149, 150, 299})
    EXPECT_EQ(x.getSwstVector()[std::size_t(k)], static_cast<float>(sim.scene().lineWindowStarts[std::size_t(k)])) << k;
  EXPECT_EQ(raster[row * 150], static_cast<float>(sim.scene().lineWindowStarts[150]));
  // The missing line is filled with zeros at the window of the line before.
  EXPECT_EQ(x.getSequenceVector()[120], 0);
  EXPECT_EQ(x.getSequenceVector()[121], 122);
  EXPECT_EQ(raster[row * 120], raster[row * 119]);
  for (std::size_t s = 1; s < row; ++s) ASSERT_EQ(raster[row * 120 + s], 0.0f);
  EXPECT_EQ(x.missingLines, 1);
  EXPECT_EQ(x.replicaLines, 3);  // lines 0, 100 and 200
  // After the 6 dB attenuation step every sample is a 4-bit level times 10^(6/20).
  const float g = static_cast<float>(std::pow(10.0, 6.0 / 20.0));
  int offGrid = 0, nonZero = 0;
  for (std::size_t s = 1; s < row; ++s) {
    const float v = raster[row * 250 + s] / g - 0.5f;
    if (std::fabs(v - std::round(v)) > 1e-4f || v < -8.0f || v > 7.0f) ++offGrid;
    if (raster[row * 250 + s] != 0.0f) ++nonZero;
  }
  EXPECT_EQ(offGrid, 0);
  EXPECT_GT(nonZero, samples);

  // Record: F2 at 32.32 MHz, the PRF of the PRI code, the first line's time.
  const GeneralRAWData& r = x.rawData;
  EXPECT_EQ(r.dataSetInfo.Swath, "F2");
  EXPECT_EQ(r.roi.Lines, 300);
  EXPECT_EQ(r.roi.Samples, samples);
  EXPECT_DOUBLE_EQ(r.sampling.frg_hz, 1.0 / 3.094e-08);
  EXPECT_NEAR(r.sampling.prf_hz, sim.scene().prfHz, 1e-9);
  EXPECT_NEAR(r.roi.SlowStartTime, sim.scene().startTime, 1e-6);
  EXPECT_DOUBLE_EQ(r.pulse.Bandwidth, 30.0e6);
  EXPECT_EQ(r.dataSetInfo.OrbitConfiguration, "DESCENDING");
  EXPECT_EQ(r.dataSetInfo.MissingLines, 1);
  // State vectors as the simulator's orbit gives them.
  GeneralSAROrbit& orbit = x.rawData.orbit();
  const StateVector sv = sim.orbit().at(orbit.t0);
  EXPECT_NEAR(orbit.pos[0], sv.pos[0], 1e-6);
  EXPECT_NEAR(orbit.vel[2], sv.vel[2], 1e-9);

  // Chirp file: the 42 us pulse (1357 samples) centred in the 1440-sample
  // replica window of the first replica line, as the 4-bit levels carried it.
  ASSERT_EQ(w->replicaSamples(), 1440);
  const std::vector<float> chirp = floats(path("scene.chirp"));
  ASSERT_EQ(static_cast<int>(chirp.size()), 2 * 1357);
  const double u0 = -0.5 * (1357 - 1) / sim.scene().samplingRateHz;
  const double ph = M_PI * sim.chirpRate() * u0 * u0;
  EXPECT_EQ(chirp[0], std::floor(static_cast<float>(6.0 * std::cos(ph))) + 0.5f);
  // The echo of a replica line starts right after the whole replica window.
  std::vector<fcomplex> echo;
  sim.renderLines(100, 1, echo);
  int shifted = 0;
  for (int j = 0; j < samples; ++j) {
    const float level = std::clamp(std::floor(echo[std::size_t(j)].real()), -8.0f, 7.0f) + 0.5f;
    if (raster[row * 100 + 1 + 2 * std::size_t(j)] != level) ++shifted;
  }
  EXPECT_EQ(shifted, 0);

  // A part of the scene: the record time and first window follow the skip.
  radarextract part;
  aim(part, *w);
  part.LinesToSkip = 10;
  part.LinesToExtract = 50;
  ASSERT_EQ(part.run(), 0);
  EXPECT_EQ(part.rawData.roi.Lines, 50);
  EXPECT_EQ(part.getSequenceVector().front(), 11);
  EXPECT_NEAR(part.rawData.roi.SlowStartTime, sim.lineTime(10), 1e-6);
  EXPECT_EQ(floats(path("scene.extracted")).size(), row * 50);

  const std::string t = trace();
  EXPECT_TRUE(support::contains(t, "Missing line detected at line 121"));
  EXPECT_TRUE(support::contains(t, "Replica samples detected at line 101"));
  EXPECT_TRUE(support::contains(t, "ADC code change"));
  EXPECT_TRUE(support::contains(t, "First Azimuth time read"));
  EXPECT_TRUE(support::contains(t, "Chirp written to file"));
}

TEST_F(RadarsatSceneTest, DamagedFilesEndWithTheirReport) {
  struct Case {
    const char* name;
    void (*damage)(RadarsatOptions&);
    int status;
    const char* message;
  };
  const Case cases[] = {
      {"head", [](RadarsatOptions& o) { o.damagedHeadLine = 39; }, 4, "Main header read failed at line 40"},
      {"beam", [](RadarsatOptions& o) { o.badBeamCode = 23; }, 1, "Beam code 23 outside 1 to 20"},
      {"truncated", [](RadarsatOptions& o) { o.truncateBytes = 16252 + 50 * 5486 + 1000; }, 4,
       "Data read error at line 51"},
      {"table layout", [](RadarsatOptions& o) { o.layout = "table"; }, 4,
       "Auxiliary header read failed at line 1"},
  };
  for (const Case& c : cases) {
    SCOPED_TRACE(c.name);
    RadarsatOptions o;
    o.beam = "S3";
    c.damage(o);
    const auto w = write(scene(64), o);
    radarextract x;
    aim(x, *w);
    EXPECT_EQ(x.run(), c.status);
    EXPECT_TRUE(support::contains(trace(), c.message)) << trace().substr(0, 2000);
  }
}

TEST_F(RadarsatSceneTest, OrbitSourceOfTheJob) {
  const auto w = write(scene(16), RadarsatOptions{});
  radarextract x;
  aim(x, *w);
  int source = -1;
  EXPECT_EQ(x.orbit_source(&source), 0);
  EXPECT_EQ(source, 1);
  x.OrbitFile = path("orbit.txt");
  support::writeText(x.OrbitFile, "neither a leader nor an orbit file");
  EXPECT_EQ(x.orbit_source(&source), 1);
  EXPECT_TRUE(support::contains(trace(), "Orbit filename is wrong!"));
  x.OrbitFile.clear();  // the leader serves
  EXPECT_EQ(x.orbit_source(&source), 0);
  EXPECT_TRUE(support::contains(trace(), "No Orbit file is present!"));

  // A text orbit file: inertial vectors a minute apart, turned Earth-fixed
  // and interpolated around the scene centre.
  std::string error;
  x.OrbitFile = path("rsat.orb");
  ASSERT_EQ(w->writeTextOrbit(x.OrbitFile, error), 0) << error;
  EXPECT_EQ(x.orbit_source(&source), 0);
  EXPECT_EQ(source, 2);
  ASSERT_EQ(x.run(), 0);
  GeneralSAROrbit& orbit = x.rawData.orbit();
  EXPECT_EQ(orbit.nSV, 5);
  for (int k = 0; k < orbit.nSV; ++k) {
    const StateVector sv = w->simulator().orbit().at(orbit.t0 + k * orbit.dt);
    for (int a = 0; a < 3; ++a) {
      EXPECT_NEAR(orbit.pos[std::size_t(3 * k + a)], sv.pos[std::size_t(a)], 2e-3);
      EXPECT_NEAR(orbit.vel[std::size_t(3 * k + a)], sv.vel[std::size_t(a)], 2e-5);
    }
  }
}

TEST_F(RadarsatSceneTest, SlcProductWithDecreasingLineTimeIsExtractedInTimeOrder) {
  SceneDescription s = scene(40);
  s.pixelTargets.clear();
  const RadarsatSceneWriter w(s, RadarsatOptions{});
  std::string error;
  ASSERT_EQ(w.writeSlc(path("sim"), true, error), 0) << error;
  radarextract x;
  aim(x, w);
  x.LinesToSkip = 5;
  x.LinesToExtract = 10;
  ASSERT_EQ(x.run(), 0);
  EXPECT_EQ(x.productLevel, 1);
  const std::vector<float> raster = floats(path("scene.extracted"));
  const std::size_t row = 2 * 1800;
  ASSERT_EQ(raster.size(), row * 10);
  // Row r holds line 5 + r of the scene, in time order.
  for (int r : {0, 9})
    for (int j : {0, 1799}) {
      int i = 0, q = 0;
      RadarsatSceneWriter::slcPixel(5 + r, j, i, q);
      EXPECT_EQ(raster[row * std::size_t(r) + 2 * std::size_t(j)], float(i)) << r << " " << j;
      EXPECT_EQ(raster[row * std::size_t(r) + 2 * std::size_t(j) + 1], float(q)) << r << " " << j;
    }
  const GeneralRAWData& rec = x.rawData;
  EXPECT_EQ(rec.roi.Lines, 10);
  EXPECT_EQ(rec.roi.Samples, 1800);
  EXPECT_NEAR(rec.roi.SlowStartTime, w.simulator().lineTime(5), 0.0005);  // line times in ms
  EXPECT_NEAR(rec.sampling.prf_hz, w.simulator().scene().prfHz, 1e-6);
  EXPECT_NEAR(rec.sampling.frg_hz, w.simulator().scene().samplingRateHz, 0.1);
  EXPECT_NEAR(rec.roi.FastStartTime, w.simulator().scene().nearRangeTime, 4e-9);  // range in whole metres
  EXPECT_TRUE(support::contains(trace(), "First Azimuth time read"));
}
