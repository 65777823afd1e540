#include "product/roi.h"

#include <gtest/gtest.h>

#include "product/profile.h"
#include "record_test_util.h"

namespace {

TEST(RoiObj, AxesIndicesAndCorners) {
  ROI_Obj r;
  r.SetFastAxe(5e-3, 1e-7, 100);
  r.SetSlowAxe(1000.0, 0.5, 40);
  EXPECT_DOUBLE_EQ(r.FastTimeLength, 1e-5);
  EXPECT_DOUBLE_EQ(r.SlowTimeLength, 20.0);
  EXPECT_FALSE(r.isNULL());
  EXPECT_EQ(r.GetSlowIndex(1000.0), 0);
  EXPECT_EQ(r.GetSlowIndex(1001.25), 3);   // 2.5 rounds away from zero
  EXPECT_EQ(r.GetSlowIndex(999.75), -1);   // -0.5 rounds away from zero
  EXPECT_EQ(r.GetSlowIndex(999.8), 0);     // -0.4
  EXPECT_EQ(r.GetSlowIndex(999.0), -2);
  EXPECT_EQ(r.GetFastIndex(5e-3 + 4.6e-7), 5);
  EXPECT_EQ(r.GetSlowRange(1.25), 3);
  EXPECT_EQ(r.GetFastRange(-2.5e-7), -3);
  EXPECT_EQ(roundHalfAway(-2.5), -3);
  EXPECT_EQ(roundHalfAway(2.4999), 2);

  double f = 0, s = 0;
  r.GetUpLeft(&f, &s);
  EXPECT_DOUBLE_EQ(f, 5e-3);
  EXPECT_DOUBLE_EQ(s, 1000.0);
  r.GetDownRight(&f, &s);
  EXPECT_DOUBLE_EQ(f, 5e-3 + 1e-5);
  EXPECT_DOUBLE_EQ(s, 1020.0);
  r.GetUpRight(&f, &s);
  EXPECT_DOUBLE_EQ(f, 5e-3 + 1e-5);
  EXPECT_DOUBLE_EQ(s, 1000.0);
  r.GetDownLeft(&f, &s);
  EXPECT_DOUBLE_EQ(f, 5e-3);
  EXPECT_DOUBLE_EQ(s, 1020.0);
  r.GetCenter(&f, &s);
  EXPECT_DOUBLE_EQ(f, 5e-3 + 5e-6);
  EXPECT_DOUBLE_EQ(s, 1010.0);
  r.ResetROI();
  EXPECT_TRUE(r.isNULL());
}

TEST(RoiObj, Intersection) {
  ROI_Obj a, b, out;
  a.SetFastAxe(0.0, 1.0, 100);
  a.SetSlowAxe(10.0, 0.5, 100);
  b.SetFastAxe(20.5, 2.0, 100);
  b.SetSlowAxe(0.0, 1.0, 30);
  ASSERT_EQ(IntersectROI(a, b, out), 0);
  EXPECT_DOUBLE_EQ(out.FastStartTime, 20.5);
  EXPECT_EQ(out.Samples, 79);  // (100 - 20.5) / 1 truncated
  EXPECT_DOUBLE_EQ(out.FastTimeLength, 79.0);
  EXPECT_DOUBLE_EQ(out.SlowStartTime, 10.0);
  EXPECT_EQ(out.Lines, 40);    // (30 - 10) / 0.5
  EXPECT_DOUBLE_EQ(out.SlowTimeDelta, 0.5);

  ROI_Obj far;
  far.SetFastAxe(500.0, 1.0, 10);
  far.SetSlowAxe(10.0, 0.5, 10);
  IntersectROI(&a, &far, &out);
  EXPECT_EQ(out.Samples, 0);
  EXPECT_EQ(out.Lines, 0);
  EXPECT_TRUE(out.isNULL());
}

TEST(RoiObj, FileRegion) {
  const std::string dir = record_test::freshDir();
  DataFile raster(dir + "/img");
  raster.NrOfPixelsPerLine = 64;
  raster.NrOfLinesPerImage = 32;
  raster.CellType = FLOAT32;
  ASSERT_EQ(raster.write_hdr(), 0);
  ROI_Obj r;
  r.SetFastAxe(6e-3, 5e-8, 64);
  r.SetSlowAxe(2000.0, 0.01, 32);
  ASSERT_EQ(r.write_roi(dir + "/img.hdr", "ROI"), 0);
  FileROI_Obj f(dir + "/img");
  ASSERT_EQ(f.read_roi(), 0);
  EXPECT_EQ(f.roi.Lines, 32);
  EXPECT_EQ(f.roi.SlowStartTime, 2000.0);
  EXPECT_EQ(f.datafile.NrOfPixelsPerLine, 64);
  EXPECT_EQ(f.datafile.CellType, FLOAT32);
  FileROI_Obj missing(dir + "/nothing");
  EXPECT_EQ(missing.read_roi(), 1);
}

}  // namespace
