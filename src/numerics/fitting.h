#pragma once
// Linear least-squares fits: general basis with a mask of fitted terms
// (normal equations in extended precision) and polynomial fits.
// Return 0 on success; failures are reported at level 0 with non-zero status.
#include <functional>

#include "numerics/nr_arrays.h"

// Basis of a general fit: fills afunc[1..ma] with the basis functions at x.
using BasisFunction = std::function<void(double x, NrVector<double>& afunc, int ma)>;
// Basis of lfit_mod: fills afunc[1..ma] for data point i (1..ndat), so that a
// caller may use any abscissa of its own (several coordinates, tables...).
using IndexedBasisFunction = std::function<void(int i, NrVector<double>& afunc, int ma)>;

// Spreads the covariance of the mfit fitted terms over covar[1..ma][1..ma]
// (zeros for terms that are held fixed), in the order of the mask ia.
void covsrt(NrMatrix<double>& covar, int ma, const NrVector<int>& ia, int mfit);

// Fit y[1..ndat] (standard deviations sig[1..ndat]) at abscissae x[1..ndat]
// by a[1..ma] . basis(x). Only terms with ia[j] != 0 are fitted, the others
// keep their value in a and are subtracted from the data. covar[1..ma][1..ma]
// receives the covariance, chisq the chi-square. Normal equations solved by
// ldgaussj. No term to fit: "lfit: no parameters to be fitted", status 1.
int lfitd(const NrVector<double>& x, const NrVector<double>& y, const NrVector<double>& sig,
          int ndat, NrVector<double>& a, const NrVector<int>& ia, int ma, NrMatrix<double>& covar,
          double* chisq, const BasisFunction& funcs);
// Same with a basis per data index. No term: "lfit_mod: no parameters to be fitted".
int lfit_mod(const NrVector<double>& y, const NrVector<double>& sig, int ndat, NrVector<double>& a,
             const NrVector<int>& ia, int ma, NrMatrix<double>& covar, double* chisq,
             const IndexedBasisFunction& funcs);

// Polynomial of degree m through n pairs (0-based arrays) by least squares;
// out[0..m] lowest power first. Status 1 for a singular system or n < 1.
int polfit(const double* x, const double* y, int n, double* out, int m);
// One polynomial per axis of order n - 1 through n equally spaced 3-vectors
// pts[3 i + k] at times t0 + i dt; coefficients lowest power first in
// cx, cy, cz (n each). With n points the fit interpolates exactly.
int orbffit(double t0, double dt, const double* pts, int n, double* cx, double* cy, double* cz);
