#include "numerics/root_finding.h"

#include <cmath>

#include "base/status.h"
#include "diag/report.h"

double rtbis(const ScalarFunction& f, double x1, double x2, double xacc, int* status) {
  constexpr int kMaxHalvings = 40;
  if (status) *status = STATUS_OK;
  const double f1 = f(x1);
  const double f2 = f(x2);
  if (f1 == 0.0) return x1;
  if (f2 == 0.0) return x2;
  if ((f1 > 0.0) == (f2 > 0.0)) {
    ORV_REPORT("Root must be bracketed for bisection in rtbis", REPORT_ERROR);
    if (status) *status = STATUS_BAD_CONDITION;
    return 0.5 * (x1 + x2);
  }
  // Walk from the end where f is negative.
  double root = f1 < 0.0 ? x1 : x2;
  double dx = f1 < 0.0 ? x2 - x1 : x1 - x2;
  double mid = root;
  for (int k = 0; k < kMaxHalvings; ++k) {
    dx *= 0.5;
    mid = root + dx;
    const double fmid = f(mid);
    if (fmid <= 0.0) root = mid;
    if (std::fabs(dx) < xacc || fmid == 0.0) return root;
  }
  ORV_REPORT("Too many bisections in rtbis", REPORT_ERROR);
  if (status) *status = STATUS_BAD_CONDITION;
  return mid;
}

double brent(double ax, double bx, double cx, const ScalarFunction& f, double tol, double* xmin,
             int* status) {
  constexpr int kMaxRounds = 100;
  constexpr double kGolden = 0.3819660112501051;  // (3 - sqrt(5)) / 2
  constexpr double kTiny = 1.0e-10;
  if (status) *status = STATUS_OK;
  double lo = std::min(ax, cx);
  double hi = std::max(ax, cx);
  double x = bx, w = bx, v = bx;
  double fx = f(x), fw = fx, fv = fx;
  double step = 0.0, prevStep = 0.0;
  for (int round = 0; round < kMaxRounds; ++round) {
    const double mid = 0.5 * (lo + hi);
    const double tol1 = tol * std::fabs(x) + kTiny;
    const double tol2 = 2.0 * tol1;
    if (std::fabs(x - mid) <= tol2 - 0.5 * (hi - lo)) {
      if (xmin) *xmin = x;
      return fx;
    }
    bool golden = true;
    if (std::fabs(prevStep) > tol1) {
      // Parabola through x, w, v.
      const double r = (x - w) * (fx - fv);
      double q = (x - v) * (fx - fw);
      double p = (x - v) * q - (x - w) * r;
      q = 2.0 * (q - r);
      if (q > 0.0) p = -p;
      q = std::fabs(q);
      const double older = prevStep;
      prevStep = step;
      if (std::fabs(p) < std::fabs(0.5 * q * older) && p > q * (lo - x) && p < q * (hi - x)) {
        step = p / q;
        const double u = x + step;
        if (u - lo < tol2 || hi - u < tol2) step = std::copysign(tol1, mid - x);
        golden = false;
      }
    }
    if (golden) {
      prevStep = (x >= mid) ? lo - x : hi - x;
      step = kGolden * prevStep;
    }
    const double u = std::fabs(step) >= tol1 ? x + step : x + std::copysign(tol1, step);
    const double fu = f(u);
    if (fu <= fx) {
      if (u >= x) lo = x; else hi = x;
      v = w; fv = fw;
      w = x; fw = fx;
      x = u; fx = fu;
    } else {
      if (u < x) lo = u; else hi = u;
      if (fu <= fw || w == x) {
        v = w; fv = fw;
        w = u; fw = fu;
      } else if (fu <= fv || v == x || v == w) {
        v = u; fv = fu;
      }
    }
  }
  ORV_REPORT("Too many iterations in brent", REPORT_ERROR);
  if (status) *status = STATUS_BAD_CONDITION;
  if (xmin) *xmin = x;
  return fx;
}

double optim_br(const ScalarFunction& f, double a, double b, double tol, double* xmin,
                int* status) {
  return brent(a, 0.5 * (a + b), b, f, tol, xmin, status);
}
