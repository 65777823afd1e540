#include "doppler/dc_estimators.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <numeric>
#include <random>
#include <set>

#include "support/files.h"
#include "support/scenes.h"

namespace {

using namespace support::clutter;

double meanOf(const std::vector<double>& v) {
  return std::accumulate(v.begin(), v.end(), 0.0) / static_cast<double>(v.size());
}

TEST(DcHistogram, BinsRoundHalfAwayFromZero) {
  // min 0, max 10, 11 bins: step 1, so x.5 values sit exactly between bins.
  const float v[] = {0.0f, 0.5f, 1.5f, 2.5f, 3.49f, 10.0f};
  std::vector<int> hist(11, -1);
  double step = -1.0, min = -1.0;
  ASSERT_EQ(make_hist(v, 6, &step, &min, hist.data(), 11), 0);
  EXPECT_DOUBLE_EQ(step, 1.0);
  EXPECT_DOUBLE_EQ(min, 0.0);
  const std::vector<int> expected = {1, 1, 1, 2, 0, 0, 0, 0, 0, 0, 1};
  EXPECT_EQ(hist, expected);
  EXPECT_EQ(hist_bin(2.5, 0.0, 1.0), 3);
  EXPECT_EQ(hist_bin(-2.5, 0.0, 1.0), -3);
  EXPECT_EQ(hist_bin(-2.49, 0.0, 1.0), -2);

  // Equal values: step 0, everything in bin 0.
  const double same[] = {4.0, 4.0, 4.0};
  ASSERT_EQ(make_hist(same, 3, &step, &min, hist.data(), 11), 0);
  EXPECT_EQ(step, 0.0);
  EXPECT_EQ(hist[0], 3);
  EXPECT_EQ(std::accumulate(hist.begin(), hist.end(), 0), 3);

  EXPECT_NE(make_hist(same, 0, &step, &min, hist.data(), 11), 0);
}

TEST(DcBlockSelection, TopPointsAreHighestAndClearOfTheBorder) {
  const int w = 64, h = 48;
  std::vector<float> map(w * h);
  std::mt19937 rng(11);
  std::uniform_real_distribution<float> u(0.0f, 1.0f);
  for (auto& v : map) v = u(rng);
  // Strong spots, two of them on the border.
  auto put = [&](int x, int y, float v) { map[y * w + x] = v; };
  put(0, 20, 100.0f);
  put(63, 47, 90.0f);
  put(30, 24, 80.0f);
  put(31, 25, 79.0f);  // overlaps the one above
  put(50, 30, 70.0f);
  put(12, 10, 60.0f);
  std::vector<MapPoint> out;
  int found = -1;
  const double sx = 16.0, sy = 12.0;
  ASSERT_EQ(topNpoints(map.data(), out, 3, w, h, sx, sy, &found), 0);
  ASSERT_EQ(found, 3);
  ASSERT_EQ(out.size(), 3u);
  EXPECT_EQ(out[0].x, 30);
  EXPECT_EQ(out[0].y, 24);
  EXPECT_EQ(out[1].x, 50);
  EXPECT_EQ(out[1].y, 30);
  EXPECT_EQ(out[2].x, 12);
  EXPECT_EQ(out[2].y, 10);

  // Asking for many more than fit: all returned points are separated,
  // inside by half a block and in descending order.
  ASSERT_EQ(topNpoints(map.data(), out, 200, w, h, sx, sy, &found), 0);
  EXPECT_EQ(found, static_cast<int>(out.size()));
  EXPECT_GT(found, 3);
  EXPECT_LT(found, 200);
  for (int i = 0; i < found; ++i) {
    EXPECT_GE(out[i].x - sx / 2, 0.0);
    EXPECT_GE(out[i].y - sy / 2, 0.0);
    EXPECT_LE(out[i].x + sx / 2, w);
    EXPECT_LE(out[i].y + sy / 2, h);
    if (i > 0) {
      EXPECT_LE(out[i].value, out[i - 1].value);
    }
    for (int j = 0; j < i; ++j)
      EXPECT_TRUE(std::abs(out[i].x - out[j].x) >= 16 || std::abs(out[i].y - out[j].y) >= 12);
  }

  // A uniform map still gives points (all cells fall in one bin).
  std::vector<float> flat(w * h, 2.0f);
  ASSERT_EQ(topNpoints(flat.data(), out, 2, w, h, sx, sy, &found), 0);
  EXPECT_EQ(found, 2);

  // A map smaller than one block has no admissible point.
  ASSERT_EQ(topNpoints(map.data(), out, 2, 10, 8, sx, sy, &found), 0);
  EXPECT_EQ(found, 0);
}

// Runs both estimators on one synthetic block of the given centroid.
void runBlock(double dcPrf, std::vector<double>& mlbf, double& wdarValue) {
  ClutterScene sc;
  sc.dcPrf = dcPrf;
  sc.points = 20;
  sc.pointAmp = 300.0;
  DcEstState st = ersState(sc, 256, 2048);
  st.blockBuf = makeClutter(sc, st.blocks, st.blockl);
  st.mlbfBlocks.assign(1, MlbfBlock{});
  st.wdarBlocks.assign(1, WdarBlock{});
  st.mlbfBlocks[0].range = st.wdarBlocks[0].range = st.blocks / 2;
  st.mlbfBlocks[0].line = st.wdarBlocks[0].line = st.blockl / 2;
  ASSERT_EQ(multimlbf_init(st), 0);
  ASSERT_EQ(chirpZ_init(st), 0);
  ASSERT_EQ(multimlbf(st, 0), 0);
  multimlbf_close();
  mlbf = st.mlbfBlocks[0].estimates;
  ASSERT_EQ(mlbf.size(), 8u);
  for (double q : st.mlbfBlocks[0].quality) EXPECT_GT(q, 1.0);
  // Wrapped centroid as a constant polynomial.
  double poly[7] = {dcPrf - std::round(dcPrf), 0, 0, 0, 0, 0, 0};
  ASSERT_EQ(wdar_init(st), 0);
  ASSERT_EQ(wdar(st, poly, 0), 0);
  wdar_close();
  wdarValue = st.wdarBlocks[0].value;
}

TEST(DcMlbf, BeatFrequencyGivesTheAbsoluteCentroid) {
  std::vector<double> wdarValues;
  for (double dc : {1.3, -0.7}) {
    std::vector<double> mlbf;
    double w = 0.0;
    runBlock(dc, mlbf, w);
    // The ambiguity follows from the estimate minus the wrapped centroid.
    const double wrapped = dc - std::round(dc);
    EXPECT_NEAR(meanOf(mlbf), dc, 0.25) << dc;
    EXPECT_EQ(std::lround(meanOf(mlbf) - wrapped), std::lround(dc - wrapped));
    EXPECT_NEAR(w, dc, 1.0) << dc;
    wdarValues.push_back(w);
  }
  // WDAR carries an offset that is the same for every block: differences of
  // centroids come out right.
  EXPECT_NEAR(wdarValues[0] - wdarValues[1], 2.0, 0.2);
}

}  // namespace
