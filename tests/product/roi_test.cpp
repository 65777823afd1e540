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

TEST(RoiObj, ElementDocumentAndProfileForms) {
  const std::string dir = record_test::freshDir();
  ROI_Obj r;
  r.SetFastAxe(5.5e-3, 5.2735e-8, 5616);
  r.SetSlowAxe(476789846.417, 1.0 / 1679.902, 28000);
  ASSERT_EQ(r.write_roi(dir + "/x.hdr", "ROI"), 0);
  ROI_Obj back;
  ASSERT_EQ(back.read_roi(dir + "/x.hdr", "ROI"), 0);
  EXPECT_EQ(record_test::g15(back.FastStartTime), record_test::g15(r.FastStartTime));
  EXPECT_EQ(record_test::g15(back.SlowStartTime), record_test::g15(r.SlowStartTime));
  EXPECT_EQ(record_test::g15(back.FastTimeDelta), record_test::g15(r.FastTimeDelta));
  EXPECT_EQ(record_test::g15(back.SlowTimeDelta), record_test::g15(r.SlowTimeDelta));
  EXPECT_EQ(record_test::g15(back.FastTimeLength), record_test::g15(r.FastTimeLength));
  EXPECT_EQ(record_test::g15(back.SlowTimeLength), record_test::g15(r.SlowTimeLength));
  EXPECT_EQ(back.Samples, 5616);
  EXPECT_EQ(back.Lines, 28000);

  // Profile form without Lines still reads; without Samples it fails.
  record_test::writeText(dir + "/old.hdr",
                         "\n[ROI]\nSlowStartTime = 12.5\nFastStartTime = 0.005\n"
                         "SlowTimeDelta = 0.1\nFastTimeDelta = 1e-07\nSlowTimeLength = 10\n"
                         "FastTimeLength = 0.0001\nSamples = 1000\n");
  ROI_Obj old;
  EXPECT_EQ(old.read_roi(dir + "/old.hdr", "ROI"), 0);
  EXPECT_DOUBLE_EQ(old.SlowStartTime, 12.5);
  EXPECT_DOUBLE_EQ(old.FastTimeDelta, 1e-7);
  EXPECT_EQ(old.Samples, 1000);
  EXPECT_EQ(old.Lines, 0);
  record_test::writeText(dir + "/nosamples.hdr", "\n[ROI]\nSlowStartTime = 12.5\nLines = 3\n");
  ROI_Obj bad;
  EXPECT_EQ(bad.read_roi(dir + "/nosamples.hdr", "ROI"), 1);
  EXPECT_EQ(bad.Lines, 3);
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

TEST(RoiObj, CoordinatesProfileForm) {
  const std::string dir = record_test::freshDir();
  record_test::writeText(dir + "/c.hdr",
                         "\n[Coordinates]\nUpLeft = {45.5 10.25}\nUpRight = {46.5 11.0}\n"
                         "DownRight = {44.0 12.25}\nLatitude_SamplingStep = 0.25\n"
                         "Longitude_SamplingStep = 0.5\n");
  ROI_Coords c;
  ASSERT_EQ(c.readhdr(dir + "/c.hdr"), 0);
  EXPECT_DOUBLE_EQ(c.SlowStartTime, 45.5);
  EXPECT_DOUBLE_EQ(c.FastStartTime, 10.25);
  EXPECT_DOUBLE_EQ(c.SlowTimeLength, 1.0);
  EXPECT_DOUBLE_EQ(c.FastTimeLength, 2.0);
  EXPECT_EQ(c.Lines, 4);
  EXPECT_EQ(c.Samples, 4);
  // Element form round trip.
  ASSERT_EQ(c.writehdr(dir + "/c.xml"), 0);
  ROI_Coords d;
  ASSERT_EQ(d.readhdr(dir + "/c.xml"), 0);
  EXPECT_DOUBLE_EQ(d.FastTimeLength, 2.0);
  EXPECT_EQ(d.Samples, 4);
}

}  // namespace
