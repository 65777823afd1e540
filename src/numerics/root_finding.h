#pragma once
// One-dimensional root finding and minimisation.
#include <functional>

using ScalarFunction = std::function<double(double)>;

// Root of f between x1 and x2 by bisection to accuracy xacc. Not bracketed:
// "Root must be bracketed for bisection in rtbis" at level 0, returns the
// midpoint of x1, x2 and sets *status to 1. After 40 halvings: "Too many
// bisections in rtbis", returns the last midpoint, status 1.
double rtbis(const ScalarFunction& f, double x1, double x2, double xacc, int* status = nullptr);

// Minimum of f bracketed by ax < bx < cx (f(bx) below both ends) by Brent's
// method to fractional tolerance tol; returns f at the minimum, *xmin its
// abscissa. Status (if given) 1 after 100 rounds without convergence.
double brent(double ax, double bx, double cx, const ScalarFunction& f, double tol, double* xmin,
             int* status = nullptr);
// Minimum of f in [a, b]: brackets it from the middle and calls brent.
double optim_br(const ScalarFunction& f, double a, double b, double tol, double* xmin,
                int* status = nullptr);
