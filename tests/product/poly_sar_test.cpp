#include "product/poly_sar.h"

#include <gtest/gtest.h>

#include "product/profile.h"
#include "record_test_util.h"

namespace {

using record_test::g15;

// Three rows 10 s apart: c0 = 1, 11, 21; the other terms equal in all rows.
template <typename T>
void fillRows(std::vector<T>& rows) {
  for (size_t k = 0; k < rows.size(); ++k) {
    const double c[7] = {10.0 * k + 1.0, 0.5, 2.0, 0.1, 0.0, 0.0, 0.0};
    for (int i = 0; i < 7; ++i) rows[k].c[i] = c[i];
    rows[k].trg0 = 0.005;
    rows[k].taz0 = 100.0 + 10.0 * k;
  }
}

TEST(PolySAR, InterpolationAndExtrapolation) {
  polySAR ps;
  ps.CreatePolys(3, 3, 3, 3, 3, 3);
  fillRows(ps.DC);
  fillRows(ps.FR);
  fillRows(ps.SL2GR);
  fillRows(ps.GR2SL);
  fillRows(ps.SL2THETA);
  fillRows(ps.SL2PHI);
  double c[7];
  ps.getDCpoly(105.0, c);
  EXPECT_DOUBLE_EQ(c[0], 6.0);
  EXPECT_DOUBLE_EQ(c[2], 2.0);
  ps.getDCpoly(90.0, c);  // below the table: from the first two rows
  EXPECT_DOUBLE_EQ(c[0], -9.0);
  EXPECT_DOUBLE_EQ(c[1], 0.5);
  ps.getFRpoly(130.0, c);  // above: from the last two rows
  EXPECT_DOUBLE_EQ(c[0], 31.0);
  ps.getSL2GRpoly(130.0, c);  // the geometric tables copy the end rows
  EXPECT_DOUBLE_EQ(c[0], 21.0);
  ps.getGR2SLpoly(90.0, c);
  EXPECT_DOUBLE_EQ(c[0], 1.0);
  ps.getSL2THETApoly(115.0, c);
  EXPECT_DOUBLE_EQ(c[0], 16.0);
  ps.getSL2PHIpoly(102.5, c);
  EXPECT_DOUBLE_EQ(c[0], 3.5);

  // DC keeps the azimuth terms with the reference of row getDCnum; the
  // others evaluate at y = 0 and ignore c2 and c3.
  EXPECT_NEAR(ps.EvaluateDCinterp(0.006, 105.0), 6 + 0.0005 + 2 * 5.0 + 0.1 * 0.001 * 5.0, 1e-12);
  EXPECT_NEAR(ps.EvaluateFRinterp(0.006, 105.0), 6.0005, 1e-12);
  EXPECT_NEAR(ps.EvaluateFRinterp(0.006, 90.0), -9.0 + 0.0005, 1e-12);
  EXPECT_NEAR(ps.EvaluateSL2GRinterp(0.006, 130.0), 21.0005, 1e-12);
  EXPECT_NEAR(ps.EvaluateGR2SLinterp(0.006, 115.0), 16.0005, 1e-12);
  EXPECT_NEAR(ps.EvaluateSL2THETAinterp(0.005, 100.0), 1.0, 1e-12);
  double v = 0;
  ASSERT_EQ(ps.EvaluateSL2PHIinterp(0.006, 120.0, &v), 0);
  EXPECT_NEAR(v, 21.0005, 1e-12);

  // One row: every getter copies it, every row number is 0.
  polySAR one;
  one.CreatePolys(1, 1, 1, 0, 0, 0);
  fillRows(one.DC);
  fillRows(one.SL2GR);
  int n = -1;
  one.getDCpoly(500.0, c);
  EXPECT_DOUBLE_EQ(c[0], 1.0);
  one.getSL2GRpoly(-5.0, c);
  EXPECT_DOUBLE_EQ(c[0], 1.0);
  one.getDCnum(500.0, &n);
  EXPECT_EQ(n, 0);
  EXPECT_EQ(one.ngr2sl, 0);
  EXPECT_TRUE(one.GR2SL.empty());
  one.DestroyPolys();
  EXPECT_EQ(one.ndc, 0);
  EXPECT_TRUE(one.DC.empty());
}

TEST(PolySAR, ProfileFormAndOlderKeys) {
  const std::string dir = record_test::freshDir();
  const std::string file = dir + "/old.hdr";
  record_test::writeText(file,
                         "\n[PolySAR]\nnDopCenDataSet = 2\nnFMRateDataSet = 1\n"
                         "\n[DopplerCentroid-0]\nDCpoly = {100 1 0 0 2 3 4}\nDCpoly_rgt0 = 0.0055\n"
                         "DCpoly_azt0 = 476789846.5\n"
                         "\n[DopplerCentroid-1]\nDCpoly = {200 1 0 0 2 3 4}\nDCpoly_rgt0 = 0.0055\n"
                         "DCpoly_azt0 = 476789856.5\n"
                         "\n[DopplerRate-0]\nFRpoly = {-2200 -1e3 0 0 0 0 0}\nFRPoly_rgt0 = 0.0056\n"
                         "FRpoly_azt0 = 476789846.5\n");
  polySAR ps;
  ASSERT_EQ(ps.readhdr(file), 0);
  ASSERT_EQ(ps.ndc, 2);
  ASSERT_EQ(ps.nfr, 1);
  EXPECT_EQ(ps.nsl2gr, 0);
  EXPECT_DOUBLE_EQ(ps.DC[1].c[0], 200.0);
  EXPECT_DOUBLE_EQ(ps.DC[0].c[6], 4.0);
  EXPECT_DOUBLE_EQ(ps.DC[1].taz0, 476789856.5);
  EXPECT_DOUBLE_EQ(ps.FR[0].trg0, 0.0056);
  EXPECT_DOUBLE_EQ(ps.FR[0].c[1], -1000.0);

  // A file without any count holds no table.
  record_test::writeText(dir + "/none.hdr", "\n[PolySAR]\nother = 1\n");
  polySAR none;
  EXPECT_EQ(none.readhdr(dir + "/none.hdr"), 1);
  EXPECT_EQ(none.ndc, 0);

  // Older key sets.
  record_test::writeText(dir + "/older.hdr",
                         "\n[Dop5]\nDopCenPol_nCoeff = 5\nDopCenRgRefTimes = 0.0055\n"
                         "DopCenAzRefSec85Times = 1000.5\nDopCenRangeCoeffs = {1 2 3 4 5}\n"
                         "\n[Dop7]\nDopCenPol_nCoeff = 7\nDopCenRgRefTimes = 0.0055\n"
                         "DopCenAzRefSec85Times = 1000.5\nDopCenRangeCoeffs = {1 2 3 4 5 6 7}\n"
                         "\n[Dop4]\nDopCenPol_nCoeff = 4\nDopCenRgRefTimes = 0.0055\n"
                         "DopCenAzRefSec85Times = 1000.5\nDopCenRangeCoeffs = {1 2 3 4}\n"
                         "\n[Rate]\nAzimuthCoeff = {-2000 5 7 8 9}\n"
                         "DopRatRangeCoeff = {1 2 3 4 5 6 7}\n"
                         "\n[Rate3]\nAzimuthCoeff = {-2000 5 7}\n");
  polyDC d5, d7, d4;
  for (auto* d : {&d5, &d7, &d4})
    for (int i = 0; i < 7; ++i) d->c[i] = 99.0;
  ASSERT_EQ(d5.readparold(dir + "/older.hdr", "Dop5"), 0);
  const double e5[7] = {1, 2, 0, 0, 3, 4, 5};
  for (int i = 0; i < 7; ++i) EXPECT_EQ(d5.c[i], e5[i]);
  EXPECT_DOUBLE_EQ(d5.trg0, 0.0055);
  EXPECT_DOUBLE_EQ(d5.taz0, 1000.5);
  ASSERT_EQ(d7.readparold(dir + "/older.hdr", "Dop7"), 0);
  for (int i = 0; i < 7; ++i) EXPECT_EQ(d7.c[i], i + 1.0);
  d4.readparold(dir + "/older.hdr", "Dop4");
  for (int i = 0; i < 7; ++i) EXPECT_EQ(d4.c[i], 99.0);

  polyFR f5, f3, f7;
  for (auto* f : {&f5, &f3, &f7})
    for (int i = 0; i < 7; ++i) f->c[i] = 99.0;
  ASSERT_EQ(f5.readparold(dir + "/older.hdr", "Rate", 5), 0);
  const double r5[7] = {-2000, 5, 0, 0, 7, 8, 9};
  for (int i = 0; i < 7; ++i) EXPECT_EQ(f5.c[i], r5[i]);
  ASSERT_EQ(f3.readparold(dir + "/older.hdr", "Rate3", 3), 0);
  const double r3[7] = {-2000, 5, 99, 7, 99, 99, 99};
  for (int i = 0; i < 7; ++i) EXPECT_EQ(f3.c[i], r3[i]);
  ASSERT_EQ(f7.readparold(dir + "/older.hdr", "Rate", 7), 0);
  for (int i = 0; i < 7; ++i) EXPECT_EQ(f7.c[i], i + 1.0);
}

}  // namespace
