#pragma once
// Linear solvers on 1-based matrices: LU and extended precision Gauss-Jordan,
// plus a plain row-major product. Every function returns 0 on success; a singular
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
int ldgaussj(NrMatrix<long double>& a, int n, NrMatrix<long double>& b, int m);

// c (ra x cb) = a (ra x ca) * b (rb x cb), row-major 0-based blocks.
// ca != rb: "\nInner matrix dimensions must agree.", status 1.
int Mmolt(const double* a, int ra, int ca, const double* b, int rb, int cb, double* c);
