#include "numerics/matrix_kernels.h"

#include <gtest/gtest.h>

#include <cmath>
#include <vector>

#include "numerics/nr_arrays.h"

namespace {

// A well-conditioned non-symmetric 4 x 4 system with a known solution.
NrMatrix<double> testMatrix() {
  const double v[16] = {4, -2, 1, 3,  3, 6, -4, 2,  2, 1, 8, -5,  1, -3, 2, 7};
  return convert_matrix(v, 1, 4, 1, 4);
}
const double kSolution[4] = {1.5, -2.25, 0.75, 3.0};

NrVector<double> rhsOf(const NrMatrix<double>& a) {
  NrVector<double> b(1, 4);
  for (int i = 1; i <= 4; ++i) {
    b[i] = 0;
    for (int j = 1; j <= 4; ++j) b[i] += a[i][j] * kSolution[j - 1];
  }
  return b;
}

TEST(LinearSolvers, LuAndGaussJordanSolveTheSameSystemAndInvert) {
  {
    NrMatrix<double> a = testMatrix();
    NrVector<double> b = rhsOf(a);
    NrVector<int> indx(1, 4);
    double d = 0;
    ASSERT_EQ(ludcmp(a, 4, indx, &d), 0);
    EXPECT_TRUE(d == 1.0 || d == -1.0);
    lubksb(a, 4, indx, b);
    for (int i = 1; i <= 4; ++i) EXPECT_NEAR(b[i], kSolution[i - 1], 1e-13);
  }
  {
    const NrMatrix<double> orig = testMatrix();
    NrMatrix<long double> a(1, 4, 1, 4), b(1, 4, 1, 1);
    NrVector<double> rhs = rhsOf(orig);
    for (int i = 1; i <= 4; ++i) {
      for (int j = 1; j <= 4; ++j) a[i][j] = orig[i][j];
      b[i][1] = rhs[i];
    }
    ASSERT_EQ(ldgaussj(a, 4, b, 1), 0);
    for (int i = 1; i <= 4; ++i) EXPECT_NEAR(static_cast<double>(b[i][1]), kSolution[i - 1], 1e-15);
  }
  {
    NrMatrix<double> a = testMatrix(), y(1, 4, 1, 4);
    ASSERT_EQ(InvMatrix(a, 4, y), 0);
    const NrMatrix<double> orig = testMatrix();
    for (int i = 1; i <= 4; ++i)
      for (int j = 1; j <= 4; ++j) {
        double s = 0;
        for (int k = 1; k <= 4; ++k) s += orig[i][k] * y[k][j];
        EXPECT_NEAR(s, i == j ? 1.0 : 0.0, 1e-14);
      }
  }
}

TEST(LinearSolvers, SingularSystemsReportAndFail) {
  const double v[9] = {1, 2, 3, 2, 4, 6, 1, 0, 1};  // rows 1 and 2 dependent
  NrMatrix<double> s1 = convert_matrix(v, 1, 3, 1, 3);
  NrVector<int> indx(1, 3);
  double d;
  EXPECT_EQ(ludcmp(s1, 3, indx, &d), 1);
  NrMatrix<long double> s3(1, 3, 1, 3), lb(1, 3, 1, 1);
  for (int i = 1; i <= 3; ++i)
    for (int j = 1; j <= 3; ++j) s3[i][j] = v[(i - 1) * 3 + j - 1];
  EXPECT_NE(ldgaussj(s3, 3, lb, 1), 0);
}

}  // namespace
