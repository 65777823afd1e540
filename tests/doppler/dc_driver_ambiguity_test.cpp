// Doppler centroid driver with its ambiguity: C-band clutter with bright
// scatterers at an absolute centroid of 1.3 PRF, resolved from the data
// (MLBF), from the geometry, or not at all.
#include <gtest/gtest.h>

#include <cmath>
#include <filesystem>
#include <string>
#include <vector>

#include "doppler/dc_driver.h"
#include "support/files.h"
#include "support/scenes.h"
#include "product/profile.h"

using namespace support::clutter;
using support::scratchDir;

namespace {

constexpr int kSamples = 1024;
constexpr int kLines = 8192;
constexpr double kTrue = 1.3;

// One scene for every case of this file, written once.
class DcDriverAmbiguity : public ::testing::Test {
 protected:
  static void SetUpTestSuite() {
    dir_ = new std::string(scratchDir("amb"));
    const Radar rd;
    ASSERT_TRUE(writeRaster(*dir_ + "/scene.rgfoc",
                            makeClutter(rd, kTrue, kSamples, kLines, 10.0, 21, 60, 300.0)));
  }
  static void TearDownTestSuite() {
    std::filesystem::remove_all(*dir_);
    delete dir_;
    dir_ = nullptr;
  }

  DcEstState state(int ambFlag) const {
    DcEstState st = ersState(rd_);
    st.blocks = 256;
    st.blockl = 2048;
    st.ambFlag = ambFlag;
    st.nBest = 4;
    st.nWdar = 3;
    return st;
  }
  DcEstInput input() const {
    return inputFor(rd_, *dir_ + "/scene.rgfoc", *dir_, kSamples, kLines);
  }
  // Largest difference from the true absolute centroid `truth` over the
  // span of the bin centres (4 x 4 bins: the quartic is not extrapolated).
  double worstError(const double poly[7], double truth) const {
    double worst = 0.0;
    for (int i = 0; i <= 8; ++i)
      for (int j = 0; j <= 8; ++j) {
        const double r = 128.0 + (kSamples - 256.0) * i / 8.0;
        const double l = 1024.0 + (kLines - 2048.0) * j / 8.0;
        worst = std::max(worst, std::fabs(polyPrf(poly, rd_, r, l) - truth));
      }
    return worst;
  }
  std::string resume() const { return *dir_ + "/DCEST_resume.txt"; }

  Radar rd_;
  static std::string* dir_;
};
std::string* DcDriverAmbiguity::dir_ = nullptr;

double readDouble(const std::string& sec, const std::string& key, const std::string& file) {
  std::vector<double> v;
  EXPECT_EQ(GetMyProfileDoubleArray(sec, key, v, 1, file), 0) << sec << "/" << key;
  return v.empty() ? std::nan("") : v[0];
}

}  // namespace

TEST_F(DcDriverAmbiguity, MlbfResolvesTheAmbiguityFromTheData) {
  DcEstState st = state(1);
  DcEstInput in = input();
  double poly[7] = {};
  testing::internal::CaptureStdout();
  const int status = getnadcpoly(in, st, poly);
  const std::string out = testing::internal::GetCapturedStdout();
  ASSERT_EQ(status, 0) << out;
  EXPECT_EQ(st.ambiguity, 1) << out;
  EXPECT_EQ(st.mlbfAmbiguity, 1);
  EXPECT_LT(worstError(poly, kTrue), 0.02) << poly[0] / rd_.prf;
  EXPECT_GT(st.nBest, 0);
  EXPECT_NE(out.find("MLBF results"), std::string::npos);

  const std::string f = resume();
  EXPECT_EQ(readDouble("Estimated_polynomial", "Estimated_ambiguity", f), 1.0);
  EXPECT_NEAR(readDouble("Estimated_polynomial", "Constant_term_Hz", f), poly[0],
              1e-12 * std::fabs(poly[0]));
  const std::string ms = "MLBF_ambiguity_estimation";
  EXPECT_EQ(readDouble(ms, "MLBF_bins_processed", f), st.nBest);
  EXPECT_EQ(readDouble(ms, "MLBF_estimates_per_bin", f), 8.0);
  EXPECT_NEAR(readDouble(ms, "Normalized_look_bandwidth", f), 0.25 * 0.72, 1e-12);
  std::vector<double> looks;
  ASSERT_EQ(GetMyProfileDoubleArray(ms, "Normalized_look_distance", looks, 8, f), 0);
  EXPECT_NEAR(looks[0], 0.36, 1e-12);
  EXPECT_NEAR(looks[7], 0.54, 1e-12);
  EXPECT_EQ(readDouble(ms, "Good_MLBF_estimates", f), st.mlbfGood);
  EXPECT_NEAR(readDouble(ms, "Mean_of_good_MLBF_estimates", f), st.mlbfMean, 1e-12);
  EXPECT_EQ(readDouble(ms, "MLBF_estimated_ambiguity", f), 1.0);
  const std::string ws = "WDAR_ambiguity_estimation";
  EXPECT_EQ(readDouble(ws, "WDAR_bins_processed", f), st.nWdar);
  EXPECT_EQ(readDouble(ws, "Geometry_estimated_ambiguity", f), st.geomAmbiguity);
  std::string text;
  ASSERT_EQ(GetMyProfileString(ws, "WDAR_offset_frequency", text, f), 0);
  if (st.wdarOffsetAvailable) {
    EXPECT_NEAR(std::stod(text), st.wdarOffset, 1e-9);
  } else {
    EXPECT_EQ(text, "NOT_AVAILABLE");
  }
  // One row per processed block: centre, then mean and std of its estimates.
  std::vector<double> row;
  ASSERT_EQ(GetMyProfileDoubleArray("MBLF_Ambiguity_estimation", "MLBF_bin_0", row, 4, f), 0);
  EXPECT_EQ(row[0], st.mlbfBlocks[0].range);
  EXPECT_EQ(row[1], st.mlbfBlocks[0].line);
  ASSERT_EQ(GetMyProfileDoubleArray("MBLF_estimates_in_each_block", "MLBF_estimates_in_bin_0", row,
                                    10, f),
            0);
  EXPECT_NEAR(row[2], st.mlbfBlocks[0].estimates[0], 1e-12);
  ASSERT_EQ(GetMyProfileString("WDAR_Ambiguity_estimation", "Legend", text, f), 0);
  EXPECT_EQ(text, "Range Line Value");
  if (st.nWdar > 0) {
    ASSERT_EQ(GetMyProfileDoubleArray("WDAR_Ambiguity_estimation", "WDAR_bin_0", row, 3, f), 0);
    EXPECT_EQ(row[0], st.wdarBlocks[0].range);
  }
  std::string none;
  EXPECT_NE(GetMyProfileString("GEOM_ambiguity_estimation", "Geometry_estimated_ambiguity", none, f),
            0);
  FreeProfile(f);
}

TEST_F(DcDriverAmbiguity, GeometryOrNothingGivesTheAmbiguity) {
  struct Case {
    int flag;
    double geomPrf;
    int ambiguity;
  };
  for (const Case c : {Case{2, 1.2, 1}, Case{2, -0.8, -1}, Case{0, 1.2, 0}}) {
    SCOPED_TRACE(c.flag * 10 + c.ambiguity);
    DcEstState st = state(c.flag);
    st.geomDoppler = c.geomPrf * rd_.prf;
    DcEstInput in = input();
    double poly[7] = {};
    testing::internal::CaptureStdout();
    ASSERT_EQ(getnadcpoly(in, st, poly), 0);
    testing::internal::GetCapturedStdout();
    EXPECT_EQ(st.ambiguity, c.ambiguity);
    EXPECT_LT(worstError(poly, kTrue - 1.0 + c.ambiguity), 0.02);
    const std::string f = resume();
    EXPECT_EQ(readDouble("Estimated_polynomial", "Estimated_ambiguity", f), c.ambiguity);
    std::string s;
    EXPECT_NE(GetMyProfileString("MLBF_ambiguity_estimation", "MLBF_bins_processed", s, f), 0);
    if (c.flag == 2) {
      EXPECT_EQ(readDouble("GEOM_ambiguity_estimation", "Geometry_estimated_ambiguity", f),
                c.ambiguity);
    }
    FreeProfile(f);
  }
  // Data-driven estimate without any block wanted: unresolved, the
  // polynomial keeps its fractional centroid and the run goes on.
  DcEstState st = state(1);
  st.nBest = 0;
  DcEstInput in = input();
  double poly[7] = {};
  testing::internal::CaptureStdout();
  ASSERT_EQ(getnadcpoly(in, st, poly), 0);
  const std::string out = testing::internal::GetCapturedStdout();
  EXPECT_NE(out.find("\nWARNING: unresolved ambiguity!\n"), std::string::npos);
  EXPECT_LT(worstError(poly, kTrue - 1.0), 0.02);
}

// Several centroids and clutter draws with the full ERS block counts.
TEST(HeavyDcDriverAmbiguity, MlbfOverCentroidsAndDraws) {
  const Radar rd;
  const std::string dir = scratchDir("amb_heavy");
  struct Case {
    double dc;
    unsigned seed;
    int ambiguity;
  };
  for (const Case c : {Case{1.3, 31, 1}, Case{-0.7, 32, -1}, Case{2.4, 33, 2}, Case{1.3, 34, 1}}) {
    SCOPED_TRACE(c.seed);
    const std::string path = dir + "/scene.rgfoc";
    ASSERT_TRUE(writeRaster(path, makeClutter(rd, c.dc, kSamples, kLines, 10.0, c.seed, 60, 300.0)));
    DcEstState st = ersState(rd);
    st.blocks = 256;
    st.blockl = 2048;
    st.ambFlag = 1;
    DcEstInput in = inputFor(rd, path, dir, kSamples, kLines);
    double poly[7] = {};
    testing::internal::CaptureStdout();
    const int status = getnadcpoly(in, st, poly);
    const std::string out = testing::internal::GetCapturedStdout();
    ASSERT_EQ(status, 0) << out;
    EXPECT_EQ(st.ambiguity, c.ambiguity) << out;
    // Bright scatterers cut by a bin edge bias the corner bins a little; the
    // centre holds the 2% of the fractional estimate.
    EXPECT_NEAR(polyPrf(poly, rd, 512.0, 4096.0), c.dc, 0.02);
    for (double r : {128.0, 512.0, 896.0})
      for (double l : {1024.0, 4096.0, 7168.0})
        EXPECT_NEAR(polyPrf(poly, rd, r, l), c.dc, 0.04) << r << " " << l;
  }
  std::filesystem::remove_all(dir);
}
