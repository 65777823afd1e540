#include "product/roi.h"

#include <gtest/gtest.h>

#include "product/profile.h"
#include "record_test_util.h"

namespace {

TEST(RoiObj, AxesAndIndices) {
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

  r.ResetROI();
  EXPECT_TRUE(r.isNULL());
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
