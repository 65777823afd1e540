#pragma once
// One-dimensional root finding.
#include <functional>

using ScalarFunction = std::function<double(double)>;

// Root of f between x1 and x2 by bisection to accuracy xacc. Not bracketed:
// "Root must be bracketed for bisection in rtbis" at level 0, returns the
// midpoint of x1, x2 and sets *status to 1. After 40 halvings: "Too many
// bisections in rtbis", returns the last midpoint, status 1.
double rtbis(const ScalarFunction& f, double x1, double x2, double xacc, int* status = nullptr);
