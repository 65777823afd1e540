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

}  // namespace
