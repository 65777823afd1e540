#include "numerics/matrix_kernels.h"

#include <cmath>
#include <new>
#include <utility>
#include <vector>

#include "base/status.h"
#include "diag/report.h"

namespace {

// Gauss-Jordan elimination with full pivoting. a becomes its inverse, b the
// solutions.
template <class T>
int gaussJordan(NrMatrix<T>& a, int n, NrMatrix<T>& b, int m) {
  std::vector<int> pivotRow(n + 1), pivotCol(n + 1), used(n + 1, 0);
  for (int step = 1; step <= n; ++step) {
    T big = 0;
    int prow = 0, pcol = 0;
    for (int i = 1; i <= n; ++i) {
      if (used[i] == 1) continue;
      for (int j = 1; j <= n; ++j) {
        if (used[j] == 0) {
          const T v = a[i][j] < 0 ? -a[i][j] : a[i][j];
          if (v >= big) {
            big = v;
            prow = i;
            pcol = j;
          }
        } else if (used[j] > 1) {
          ORV_REPORT("ld-gaussj: Singular Matrix-1", REPORT_ERROR);
          return STATUS_BAD_CONDITION;
        }
      }
    }
    if (pcol == 0) {
      ORV_REPORT("ld-gaussj: Singular Matrix-1", REPORT_ERROR);
      return STATUS_BAD_CONDITION;
    }
    ++used[pcol];
    // Bring the pivot onto the diagonal by a row interchange.
    if (prow != pcol) {
      for (int j = 1; j <= n; ++j) std::swap(a[prow][j], a[pcol][j]);
      for (int j = 1; j <= m; ++j) std::swap(b[prow][j], b[pcol][j]);
    }
    pivotRow[step] = prow;
    pivotCol[step] = pcol;
    if (a[pcol][pcol] == 0) {
      ORV_REPORT("ld-gaussj: Singular Matrix-2", REPORT_ERROR);
      return STATUS_BAD_CONDITION;
    }
    const T inv = T(1) / a[pcol][pcol];
    a[pcol][pcol] = 1;
    for (int j = 1; j <= n; ++j) a[pcol][j] *= inv;
    for (int j = 1; j <= m; ++j) b[pcol][j] *= inv;
    for (int r = 1; r <= n; ++r) {
      if (r == pcol) continue;
      const T factor = a[r][pcol];
      if (factor == 0) continue;
      a[r][pcol] = 0;
      for (int j = 1; j <= n; ++j) a[r][j] -= a[pcol][j] * factor;
      for (int j = 1; j <= m; ++j) b[r][j] -= b[pcol][j] * factor;
    }
  }
  // Undo the column permutation implied by the row interchanges, last first.
  for (int step = n; step >= 1; --step) {
    if (pivotRow[step] != pivotCol[step])
      for (int i = 1; i <= n; ++i) std::swap(a[i][pivotRow[step]], a[i][pivotCol[step]]);
  }
  return STATUS_OK;
}

}  // namespace

int ludcmp(NrMatrix<double>& a, int n, NrVector<int>& indx, double* d) {
  std::vector<double> scale(n + 1);
  double sign = 1.0;
  for (int i = 1; i <= n; ++i) {
    double big = 0.0;
    for (int j = 1; j <= n; ++j) big = std::max(big, std::fabs(a[i][j]));
    if (big == 0.0) {
      ORV_REPORT("Singular matrix in lud decomposition", REPORT_ERROR);
      return STATUS_BAD_CONDITION;
    }
    scale[i] = 1.0 / big;
  }
  for (int k = 1; k <= n; ++k) {
    // Implicitly scaled partial pivoting.
    double best = 0.0;
    int p = k;
    for (int i = k; i <= n; ++i) {
      const double v = scale[i] * std::fabs(a[i][k]);
      if (v > best) {
        best = v;
        p = i;
      }
    }
    if (best == 0.0) {
      ORV_REPORT("Singular matrix in lud decomposition", REPORT_ERROR);
      return STATUS_BAD_CONDITION;
    }
    if (p != k) {
      for (int j = 1; j <= n; ++j) std::swap(a[p][j], a[k][j]);
      std::swap(scale[p], scale[k]);
      sign = -sign;
    }
    indx[k] = p;
    const double pivot = a[k][k];
    for (int i = k + 1; i <= n; ++i) {
      const double l = a[i][k] / pivot;
      a[i][k] = l;
      if (l == 0.0) continue;
      for (int j = k + 1; j <= n; ++j) a[i][j] -= l * a[k][j];
    }
  }
  if (d) *d = sign;
  return STATUS_OK;
}

void lubksb(const NrMatrix<double>& a, int n, const NrVector<int>& indx, NrVector<double>& b) {
  for (int k = 1; k <= n; ++k)
    if (indx[k] != k) std::swap(b[k], b[indx[k]]);
  for (int i = 2; i <= n; ++i) {
    double s = b[i];
    for (int j = 1; j < i; ++j) s -= a[i][j] * b[j];
    b[i] = s;
  }
  for (int i = n; i >= 1; --i) {
    double s = b[i];
    for (int j = i + 1; j <= n; ++j) s -= a[i][j] * b[j];
    b[i] = s / a[i][i];
  }
}

int InvMatrix(NrMatrix<double>& a, int n, NrMatrix<double>& y) {
  try {
    NrVector<int> indx(1, n);
    NrVector<double> col(1, n);
    double d = 0.0;
    const int status = ludcmp(a, n, indx, &d);
    if (status != STATUS_OK) {
      ORV_REPORT_CALLED_ERROR();
      return status;
    }
    for (int j = 1; j <= n; ++j) {
      col.fill(0.0);
      col[j] = 1.0;
      lubksb(a, n, indx, col);
      for (int i = 1; i <= n; ++i) y[i][j] = col[i];
    }
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  return STATUS_OK;
}

int MatInv(const double* a, double* ainv, int n) {
  try {
    NrMatrix<double> m = convert_matrix(a, 1, n, 1, n);
    NrMatrix<double> y(1, n, 1, n);
    const int status = InvMatrix(m, n, y);
    if (status != STATUS_OK) {
      ORV_REPORT_CALLED_ERROR();
      return status;
    }
    for (int i = 0; i < n; ++i)
      for (int j = 0; j < n; ++j) ainv[i * n + j] = y[i + 1][j + 1];
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  return STATUS_OK;
}

int ldgaussj(NrMatrix<long double>& a, int n, NrMatrix<long double>& b, int m) {
  return gaussJordan(a, n, b, m);
}

int Mmolt(const double* a, int ra, int ca, const double* b, int rb, int cb, double* c) {
  if (ca != rb) {
    ORV_REPORT("\nInner matrix dimensions must agree.", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  for (int i = 0; i < ra; ++i)
    for (int j = 0; j < cb; ++j) {
      double s = 0.0;
      for (int k = 0; k < ca; ++k) s += a[i * ca + k] * b[k * cb + j];
      c[i * cb + j] = s;
    }
  return STATUS_OK;
}
