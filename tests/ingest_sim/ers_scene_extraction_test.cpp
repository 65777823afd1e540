// The ERS extractor on scenes written by the simulator, clean and damaged.
#include <gtest/gtest.h>
#include <unistd.h>

#include <cmath>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "ingest/ers/ers_extractor.h"
#include "ingest/ers/ers_level0.h"
#include "orbit/general_sar_orbit.h"
#include "product/product_aggregates.h"
#include "product/time_base.h"
#include "sim/raw_scene.h"
#include "support/files.h"

namespace {

namespace fs = std::filesystem;

constexpr int kLines = 300;
constexpr int kSamples = 1024;

class ErsSceneTest : public testing::Test {
 protected:
  void SetUp() override {
    std::string error;
    ASSERT_TRUE(SceneDescription::load(TESSIVOR_SOURCE_DIR "/tests/sim/data/ers2_small_scene.txt", scene_, error))
        << error;
    scene_.lines = kLines;
    scene_.samples = kSamples;
    scene_.odrRecords = 120;
    scene_.pixelTargets = {{150.0, 600.0, 0.0, 4.0}};
  }

  // Writes the scene and returns its simulator.
  std::unique_ptr<RawSceneSimulator> write() {
    auto sim = std::make_unique<RawSceneSimulator>(scene_);
    std::string error;
    EXPECT_EQ(sim->writeErsScene(dir_.str(), error), 0) << error;
    return sim;
  }

  void aim(ATERSExtractor& x, const RawSceneSimulator& sim) const {
    x.LeaFilename = sim.leaderPath(dir_.str());
    x.ImgFilename = sim.imagePath(dir_.str());
    x.OrbitFilename = sim.odrPath(dir_.str());
    x.OutputFile = out();
    x.ChirpFile = out() + ".chirp";
  }

  std::string out() const { return (dir_ / "scene.extracted"); }

  // Quantised bytes of every simulated line.
  static std::vector<unsigned char> quantised(const RawSceneSimulator& sim) {
    std::vector<fcomplex> echoes;
    sim.renderLines(0, kLines, echoes);
    std::vector<unsigned char> bytes(2 * std::size_t(kLines) * kSamples);
    for (int k = 0; k < kLines; ++k)
      sim.quantiseLine(echoes.data() + std::size_t(k) * kSamples, bytes.data() + 2 * std::size_t(k) * kSamples);
    return bytes;
  }

  static float prefixOf(int code) { return static_cast<float>(ersSwstSeconds(code)); }

  support::TempFolder dir_{"ingest_sim"};
  SceneDescription scene_;
};

}  // namespace

TEST_F(ErsSceneTest, CleanSceneRasterRecordAndVectors) {
  scene_.swstChangeLine = 200;
  scene_.swstChangeCodes = 4;
  const auto sim = write();
  ATERSExtractor x;
  aim(x, *sim);
  ASSERT_EQ(x.run(), 0);

  // The raster is the simulated I/Q less 15.5 (no biases), each line
  // prefixed with its window start.
  const std::vector<unsigned char> iq = quantised(*sim);
  const std::vector<float> raster = support::readValues<float>(out());
  const std::size_t row = 1 + 2 * std::size_t(kSamples);
  ASSERT_EQ(raster.size(), row * kLines);
  int mismatches = 0;
  for (int k = 0; k < kLines; ++k) {
    const float* r = raster.data() + row * std::size_t(k);
    if (r[0] != prefixOf(sim->swstCodeOf(k))) ++mismatches;
    for (int s = 0; s < 2 * kSamples; ++s)
      if (r[1 + s] != static_cast<float>(iq[2 * std::size_t(k) * kSamples + std::size_t(s)]) - 15.5f) ++mismatches;
  }
  EXPECT_EQ(mismatches, 0);

  ASSERT_EQ(x.getVectorLength(), kLines);
  for (int k = 0; k < kLines; ++k) {
    EXPECT_EQ(x.getSwstVector()[k], sim->swstCodeOf(k)) << k;
    EXPECT_EQ(x.getMissingVector()[k], 0) << k;
    EXPECT_EQ(x.getCounterVector()[k], k + 1) << k;
  }

  // The record written with the raster, read back.
  GeneralRAWData r;
  ASSERT_EQ(r.readhdr(out() + ".hdr"), 0);
  EXPECT_EQ(r.roi.Lines, kLines);
  EXPECT_EQ(r.roi.Samples, kSamples);
  EXPECT_EQ(r.dataFile.NrOfPixelsPerLine, kSamples);
  EXPECT_EQ(r.dataFile.RowPrefix, 4);
  EXPECT_NEAR(r.roi.FastStartTime, double(prefixOf(sim->swstCode())), 1e-12);
  EXPECT_NEAR(r.dataSetInfo.SWST_MIN, double(prefixOf(sim->swstCode())), 1e-12);
  EXPECT_NEAR(r.dataSetInfo.SWST_MAX, double(prefixOf(sim->swstCode() + 4)), 1e-12);
  EXPECT_EQ(r.dataSetInfo.MissingLines, 0);
  EXPECT_TRUE(r.dataSetInfo.IsImageType(DataSetInfo_Obj::IT_RAW_DATA));
  EXPECT_TRUE(r.dataSetInfo.IsSensorType(DataSetInfo_Obj::ST_ERS2));
  EXPECT_NEAR(r.swath.Rgate_bias, -6.627e-06, 1e-18);

  // The orbit comes from the precise arc and follows the simulated one.
  GeneralSAROrbit& orbit = r.orbit();
  ASSERT_GT(orbit.nSV, 4);
  const double t = sim->lineTime(kLines / 2);
  double pos[3];
  ASSERT_EQ(orbit.SVGetPos(t, pos), 0);
  const auto sv = sim->orbit().at(t);
  const double d = std::hypot(pos[0] - sv.pos[0], pos[1] - sv.pos[1], pos[2] - sv.pos[2]);
  EXPECT_LT(d, 2.0);

  // The generated chirp: round(fs T) samples.
  EXPECT_EQ(fs::file_size(out() + ".chirp"), std::uintmax_t(sim->replicaLength()) * 8u);
}
