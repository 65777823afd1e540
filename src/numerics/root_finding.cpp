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
