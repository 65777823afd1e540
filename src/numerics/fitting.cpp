#include "numerics/fitting.h"

#include <cmath>
#include <new>
#include <vector>

#include "base/status.h"
#include "diag/report.h"
#include "numerics/matrix_kernels.h"

void covsrt(NrMatrix<double>& covar, int ma, const NrVector<int>& ia, int mfit) {
  std::vector<int> fitted;
  for (int j = 1; j <= ma; ++j)
    if (ia[j] != 0) fitted.push_back(j);
  if (static_cast<int>(fitted.size()) > mfit) fitted.resize(mfit);
  const int nf = static_cast<int>(fitted.size());
  std::vector<double> block(static_cast<std::size_t>(nf) * nf);
  for (int p = 0; p < nf; ++p)
    for (int q = 0; q < nf; ++q) block[p * nf + q] = covar[p + 1][q + 1];
  for (int i = 1; i <= ma; ++i)
    for (int j = 1; j <= ma; ++j) covar[i][j] = 0.0;
  for (int p = 0; p < nf; ++p)
    for (int q = 0; q < nf; ++q) covar[fitted[p]][fitted[q]] = block[p * nf + q];
}

namespace {

// Normal equations of a masked linear fit, accumulated in extended precision
// and solved by Gauss-Jordan. basisAt(i, afunc) fills the basis of point i.
template <class BasisAt>
int maskedFit(const NrVector<double>& y, const NrVector<double>& sig, int ndat,
              NrVector<double>& a, const NrVector<int>& ia, int ma, NrMatrix<double>& covar,
              double* chisq, const BasisAt& basisAt, const char* emptyMessage) {
  int mfit = 0;
  for (int j = 1; j <= ma; ++j)
    if (ia[j] != 0) ++mfit;
  if (mfit == 0) {
    ORV_REPORT(emptyMessage, REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  try {
    NrMatrix<long double> alpha(1, mfit, 1, mfit);
    NrMatrix<long double> beta(1, mfit, 1, 1);
    NrVector<double> afunc(1, ma);
    for (int i = 1; i <= ndat; ++i) {
      basisAt(i, afunc);
      long double ym = y[i];
      for (int j = 1; j <= ma; ++j)
        if (ia[j] == 0) ym -= static_cast<long double>(a[j]) * afunc[j];
      const long double wt = 1.0L / (static_cast<long double>(sig[i]) * sig[i]);
      for (int j = 1, jj = 0; j <= ma; ++j) {
        if (ia[j] == 0) continue;
        ++jj;
        const long double wj = afunc[j] * wt;
        for (int k = 1, kk = 0; k <= j; ++k) {
          if (ia[k] == 0) continue;
          ++kk;
          alpha[jj][kk] += wj * afunc[k];
        }
        beta[jj][1] += ym * wj;
      }
    }
    for (int j = 2; j <= mfit; ++j)
      for (int k = 1; k < j; ++k) alpha[k][j] = alpha[j][k];
    const int status = ldgaussj(alpha, mfit, beta, 1);
    if (status != STATUS_OK) {
      ORV_REPORT_CALLED_ERROR();
      return status;
    }
    for (int j = 1, jj = 0; j <= ma; ++j)
      if (ia[j] != 0) a[j] = static_cast<double>(beta[++jj][1]);
    long double chi = 0.0L;
    for (int i = 1; i <= ndat; ++i) {
      basisAt(i, afunc);
      long double s = 0.0L;
      for (int j = 1; j <= ma; ++j) s += static_cast<long double>(a[j]) * afunc[j];
      const long double r = (y[i] - s) / sig[i];
      chi += r * r;
    }
    if (chisq) *chisq = static_cast<double>(chi);
    for (int j = 1; j <= mfit; ++j)
      for (int k = 1; k <= mfit; ++k) covar[j][k] = static_cast<double>(alpha[j][k]);
    covsrt(covar, ma, ia, mfit);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  return STATUS_OK;
}

}  // namespace

int lfitd(const NrVector<double>& x, const NrVector<double>& y, const NrVector<double>& sig,
          int ndat, NrVector<double>& a, const NrVector<int>& ia, int ma, NrMatrix<double>& covar,
          double* chisq, const BasisFunction& funcs) {
  auto basisAt = [&](int i, NrVector<double>& afunc) { funcs(x[i], afunc, ma); };
  const int status = maskedFit(y, sig, ndat, a, ia, ma, covar, chisq, basisAt,
                               "lfit: no parameters to be fitted");
  if (status != STATUS_OK) ORV_REPORT_CALLED_ERROR();
  return status;
}

int lfit_mod(const NrVector<double>& y, const NrVector<double>& sig, int ndat, NrVector<double>& a,
             const NrVector<int>& ia, int ma, NrMatrix<double>& covar, double* chisq,
             const IndexedBasisFunction& funcs) {
  auto basisAt = [&](int i, NrVector<double>& afunc) { funcs(i, afunc, ma); };
  const int status = maskedFit(y, sig, ndat, a, ia, ma, covar, chisq, basisAt,
                               "lfit_mod: no parameters to be fitted");
  if (status != STATUS_OK) ORV_REPORT_CALLED_ERROR();
  return status;
}

namespace {

// Polynomial with ncoef coefficients (lowest power first) by the normal
// equations in extended precision.
int normalPolyFit(const double* x, const double* y, int n, double* out, int ncoef, double* err) {
  if (ncoef < 1 || n < 1) {
    ORV_REPORT("polfit: no data or no coefficient to fit", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  try {
    NrMatrix<long double> nm(1, ncoef, 1, ncoef);
    NrMatrix<long double> rhs(1, ncoef, 1, 1);
    std::vector<long double> powSum(2 * ncoef - 1, 0.0L);
    for (int i = 0; i < n; ++i) {
      const long double xi = x[i];
      long double p = 1.0L;
      for (int k = 0; k < 2 * ncoef - 1; ++k) {
        powSum[k] += p;
        if (k < ncoef) rhs[k + 1][1] += p * y[i];
        p *= xi;
      }
    }
    for (int j = 0; j < ncoef; ++j)
      for (int k = 0; k < ncoef; ++k) nm[j + 1][k + 1] = powSum[j + k];
    const int status = ldgaussj(nm, ncoef, rhs, 1);
    if (status != STATUS_OK) {
      ORV_REPORT_CALLED_ERROR();
      return status;
    }
    for (int j = 0; j < ncoef; ++j) out[j] = static_cast<double>(rhs[j + 1][1]);
    if (err) {
      long double e = 0.0L;
      for (int i = 0; i < n; ++i) {
        long double s = 0.0L;
        for (int j = ncoef - 1; j >= 0; --j) s = s * x[i] + out[j];
        const long double r = y[i] - s;
        e += r * r;
      }
      *err = static_cast<double>(e);
    }
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  return STATUS_OK;
}

}  // namespace

int polfit(const double* x, const double* y, int n, double* out, int m) {
  const int status = normalPolyFit(x, y, n, out, m + 1, nullptr);
  if (status != STATUS_OK) ORV_REPORT_CALLED_ERROR();
  return status;
}

int orbffit(double t0, double dt, const double* pts, int n, double* cx, double* cy, double* cz) {
  try {
    std::vector<double> t(n), v(n);
    for (int i = 0; i < n; ++i) t[i] = t0 + i * dt;
    double* out[3] = {cx, cy, cz};
    for (int k = 0; k < 3; ++k) {
      for (int i = 0; i < n; ++i) v[i] = pts[3 * i + k];
      const int status = normalPolyFit(t.data(), v.data(), n, out[k], n, nullptr);
      if (status != STATUS_OK) {
        ORV_REPORT_CALLED_ERROR();
        return status;
      }
    }
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  return STATUS_OK;
}
