#pragma once
// Small kernels on 3-vectors and small row-major matrices.

// Unit vector of v; a zero vector gives zero.
void make_versor(const double v[3], double out[3]);
// Cross product a x b (out may not alias a or b).
void v1pv2(const double a[3], const double b[3], double out[3]);
// Determinant of a row-major 3 x 3 matrix.
double determ(const double m[9]);
// Inverse of a row-major 3 x 3 matrix; status 1 if singular.
int inv3x3(const double m[9], double out[9]);
// out = a * b for row-major 3 x 3 matrices.
void mul3x3(const double a[9], const double b[9], double out[9]);
// out = m * v.
void mul3x1(const double m[9], const double v[3], double out[3]);
// out (n x p) = a (n x m) * b (m x p), row-major.
void mul(const double* a, const double* b, double* out, int n, int m, int p);
// out (n) = a (n x m) * v (m), row-major.
void mul_NxM_M(const double* a, const double* v, double* out, int n, int m);
// out (m x n) = transpose of a (n x m), row-major.
void tran(const double* a, double* out, int n, int m);
// Cosine of the angle between a and b; 0 if either is zero; a value outside
// -1 .. 1 becomes 1.
double COS_PHI_V(const double a[3], const double b[3]);
double dot3(const double a[3], const double b[3]);
double norm3(const double a[3]);
// c[0] (x - x0)^2 + c[1] (x - x0) + c[2].
double fdc_interp(double x, double x0, const double c[3]);
