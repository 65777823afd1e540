#include "numerics/matrix_kernels.h"

#include <cmath>
#include <new>
#include <utility>
#include <vector>

#include "base/status.h"
#include "diag/report.h"

namespace {

// Gauss-Jordan elimination with full pivoting, shared by the double and the
// extended precision forms. a becomes its inverse, b the solutions.
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

int gaussj(NrMatrix<double>& a, int n, NrMatrix<double>& b, int m) {
  return gaussJordan(a, n, b, m);
}

int ldgaussj(NrMatrix<long double>& a, int n, NrMatrix<long double>& b, int m) {
  return gaussJordan(a, n, b, m);
}

// One-sided Jacobi (Hestenes) orthogonalisation: plane rotations applied to
// pairs of columns of A until all columns are mutually orthogonal. The
// rotations accumulate in V; the column norms are the singular values.
int svdcmp(NrMatrix<double>& a, int m, int n, NrVector<double>& w, NrMatrix<double>& v) {
  if (m < n) {
    ORV_REPORT("SVDCMP: You must augment A with extra zero rows", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  for (int i = 1; i <= n; ++i)
    for (int j = 1; j <= n; ++j) v[i][j] = (i == j) ? 1.0 : 0.0;
  const double eps = 1e-15;
  bool converged = false;
  for (int sweep = 0; sweep < 60 && !converged; ++sweep) {
    converged = true;
    for (int p = 1; p < n; ++p) {
      for (int q = p + 1; q <= n; ++q) {
        double alpha = 0.0, beta = 0.0, gamma = 0.0;
        for (int i = 1; i <= m; ++i) {
          alpha += a[i][p] * a[i][p];
          beta += a[i][q] * a[i][q];
          gamma += a[i][p] * a[i][q];
        }
        if (gamma == 0.0 || std::fabs(gamma) <= eps * std::sqrt(alpha * beta)) continue;
        converged = false;
        const double zeta = (beta - alpha) / (2.0 * gamma);
        const double t = std::copysign(1.0, zeta) / (std::fabs(zeta) + std::sqrt(1.0 + zeta * zeta));
        const double c = 1.0 / std::sqrt(1.0 + t * t);
        const double s = c * t;
        for (int i = 1; i <= m; ++i) {
          const double ap = a[i][p], aq = a[i][q];
          a[i][p] = c * ap - s * aq;
          a[i][q] = s * ap + c * aq;
        }
        for (int i = 1; i <= n; ++i) {
          const double vp = v[i][p], vq = v[i][q];
          v[i][p] = c * vp - s * vq;
          v[i][q] = s * vp + c * vq;
        }
      }
    }
  }
  if (!converged) {
    ORV_REPORT("No convergence in 60 SVDCMP iterations", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  for (int j = 1; j <= n; ++j) {
    double s = 0.0;
    for (int i = 1; i <= m; ++i) s += a[i][j] * a[i][j];
    s = std::sqrt(s);
    w[j] = s;
    if (s > 0.0)
      for (int i = 1; i <= m; ++i) a[i][j] /= s;
  }
  return STATUS_OK;
}

void svbksb(const NrMatrix<double>& u, const NrVector<double>& w, const NrMatrix<double>& v, int m,
            int n, const NrVector<double>& b, NrVector<double>& x) {
  std::vector<double> tmp(n + 1, 0.0);
  for (int j = 1; j <= n; ++j) {
    if (w[j] == 0.0) continue;
    double s = 0.0;
    for (int i = 1; i <= m; ++i) s += u[i][j] * b[i];
    tmp[j] = s / w[j];
  }
  for (int i = 1; i <= n; ++i) {
    double s = 0.0;
    for (int j = 1; j <= n; ++j) s += v[i][j] * tmp[j];
    x[i] = s;
  }
}

namespace {

// Householder reduction of columns 1..ncols of the rows 1..nrows of a.
// Column k's reflector is stored below the diagonal (including it) with its
// normalisation in c[k]; the diagonal of R is d[k]. Returns true if singular.
bool householder(NrMatrix<double>& a, int nrows, int ncols, NrVector<double>& c,
                 NrVector<double>& d) {
  bool singular = false;
  for (int k = 1; k <= ncols; ++k) {
    if (k == nrows) {  // square case: last column has nothing below
      c[k] = 0.0;
      d[k] = a[k][k];
      if (d[k] == 0.0) singular = true;
      continue;
    }
    double scale = 0.0;
    for (int i = k; i <= nrows; ++i) scale = std::max(scale, std::fabs(a[i][k]));
    if (scale == 0.0) {
      singular = true;
      c[k] = d[k] = 0.0;
      continue;
    }
    double norm2 = 0.0;
    for (int i = k; i <= nrows; ++i) {
      a[i][k] /= scale;
      norm2 += a[i][k] * a[i][k];
    }
    const double sigma = std::copysign(std::sqrt(norm2), a[k][k]);
    a[k][k] += sigma;
    c[k] = sigma * a[k][k];
    d[k] = -scale * sigma;
    for (int j = k + 1; j <= ncols; ++j) {
      double s = 0.0;
      for (int i = k; i <= nrows; ++i) s += a[i][k] * a[i][j];
      const double tau = s / c[k];
      for (int i = k; i <= nrows; ++i) a[i][j] -= tau * a[i][k];
    }
  }
  return singular;
}

void applyQt(const NrMatrix<double>& a, int nrows, int ncols, const NrVector<double>& c,
             NrVector<double>& b) {
  for (int k = 1; k <= ncols; ++k) {
    if (c[k] == 0.0) continue;
    double s = 0.0;
    for (int i = k; i <= nrows; ++i) s += a[i][k] * b[i];
    const double tau = s / c[k];
    for (int i = k; i <= nrows; ++i) b[i] -= tau * a[i][k];
  }
}

void backSubstitute(const NrMatrix<double>& a, int n, const NrVector<double>& d,
                    NrVector<double>& b) {
  for (int i = n; i >= 1; --i) {
    double s = b[i];
    for (int j = i + 1; j <= n; ++j) s -= a[i][j] * b[j];
    b[i] = s / d[i];
  }
}

}  // namespace

int qrdcmp(NrMatrix<double>& a, int n, NrVector<double>& c, NrVector<double>& d, bool* sing) {
  const bool singular = householder(a, n, n, c, d);
  if (sing) *sing = singular;
  if (singular) {
    ORV_REPORT("Singular matrix in qrdcmp", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  return STATUS_OK;
}

void qrsolv(const NrMatrix<double>& a, int n, const NrVector<double>& c, const NrVector<double>& d,
            NrVector<double>& b) {
  applyQt(a, n, n, c, b);
  backSubstitute(a, n, d, b);
}

int qr_solve(const NrMatrix<double>& a, int m, int n, const NrVector<double>& b,
             NrVector<double>& x) {
  if (m < n) {
    ORV_REPORT("qr_solve: fewer equations than unknowns", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  try {
    NrMatrix<double> q = submatrix(a, 1, m, 1, n, 1, 1);
    NrVector<double> c(1, n), d(1, n), rhs(1, m);
    for (int i = 1; i <= m; ++i) rhs[i] = b[i];
    if (householder(q, m, n, c, d)) {
      ORV_REPORT("Singular matrix in qr_solve", REPORT_ERROR);
      return STATUS_BAD_CONDITION;
    }
    applyQt(q, m, n, c, rhs);
    backSubstitute(q, n, d, rhs);
    for (int i = 1; i <= n; ++i) x[i] = rhs[i];
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  return STATUS_OK;
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

void Transpose_Matrix(const double* a, int r, int c, double* t) {
  for (int i = 0; i < r; ++i)
    for (int j = 0; j < c; ++j) t[j * r + i] = a[i * c + j];
}
