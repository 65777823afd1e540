#pragma once
// Linear solvers on 1-based matrices: LU, Gauss-Jordan (double and extended
// precision), singular value decomposition and QR, plus plain row-major
// products and transposes. Every function returns 0 on success; a singular
// system or a bad argument is reported at level 0 and gives a non-zero status
// (1, or 7 when memory is out). Nothing aborts the process.
#include "numerics/nr_arrays.h"

// LU decomposition with partial pivoting of a[1..n][1..n], in place.
// indx[1..n] receives the row permutation, d (if given) +1 or -1 for an even
// or odd number of interchanges. Singular: "Singular matrix in lud
// decomposition", status 1.
int ludcmp(NrMatrix<double>& a, int n, NrVector<int>& indx, double* d);
// Solves A x = b with the output of ludcmp; b[1..n] becomes x.
void lubksb(const NrMatrix<double>& a, int n, const NrVector<int>& indx, NrVector<double>& b);

// Inverse of a[1..n][1..n] by LU into y[1..n][1..n]; a is overwritten by its LU.
int InvMatrix(NrMatrix<double>& a, int n, NrMatrix<double>& y);
// Inverse of the row-major n x n block a (0-based) into ainv; a is kept.
int MatInv(const double* a, double* ainv, int n);

// Gauss-Jordan elimination with full pivoting: a[1..n][1..n] becomes its
// inverse and b[1..n][1..m] the solutions of the m right-hand sides.
// Singular: "ld-gaussj: Singular Matrix-1" / "ld-gaussj: Singular Matrix-2".
int gaussj(NrMatrix<double>& a, int n, NrMatrix<double>& b, int m);
int ldgaussj(NrMatrix<long double>& a, int n, NrMatrix<long double>& b, int m);

// Singular value decomposition a = U W V^T of a[1..m][1..n], m >= n: a
// becomes U, w[1..n] the singular values, v[1..n][1..n] the matrix V (not its
// transpose). m < n: "SVDCMP: You must augment A with extra zero rows",
// status 1. No convergence: "No convergence in 60 SVDCMP iterations", status 1.
int svdcmp(NrMatrix<double>& a, int m, int n, NrVector<double>& w, NrMatrix<double>& v);
// x[1..n] = V diag(1/w) U^T b[1..m]; a zero singular value contributes nothing.
void svbksb(const NrMatrix<double>& u, const NrVector<double>& w, const NrMatrix<double>& v, int m,
            int n, const NrVector<double>& b, NrVector<double>& x);

// Householder QR of the square a[1..n][1..n], in place: R is in the upper
// triangle with its diagonal in d[1..n], the reflectors below and in c[1..n].
// sing (if given) is set when a zero diagonal appears (status 1 then).
int qrdcmp(NrMatrix<double>& a, int n, NrVector<double>& c, NrVector<double>& d, bool* sing);
// Solves A x = b with the output of qrdcmp; b[1..n] becomes x.
void qrsolv(const NrMatrix<double>& a, int n, const NrVector<double>& c, const NrVector<double>& d,
            NrVector<double>& b);
// Least-squares solution x[1..n] of a[1..m][1..n] x = b[1..m] (m >= n) by
// Householder QR; a is left unchanged. Rank deficiency gives status 1.
int qr_solve(const NrMatrix<double>& a, int m, int n, const NrVector<double>& b, NrVector<double>& x);

// c (ra x cb) = a (ra x ca) * b (rb x cb), row-major 0-based blocks.
// ca != rb: "\nInner matrix dimensions must agree.", status 1.
int Mmolt(const double* a, int ra, int ca, const double* b, int rb, int cb, double* c);
// t (c x r) = transpose of a (r x c), row-major 0-based blocks.
void Transpose_Matrix(const double* a, int r, int c, double* t);
