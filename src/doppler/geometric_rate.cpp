// Doppler rate polynomial of a scene from its orbit, with its drift along
// the scene.
#include "doppler/geometric_rate.h"

#include "base/status.h"
#include "diag/report.h"
#include "orbit/general_sar_orbit.h"
#include "orbit/geo_grid.h"
#include "product/poly_sar.h"

namespace {

int rangeFit(GeneralSAROrbit& orbit, double t, double swstMin, int samples, double frg, double fc,
             const polyDC& dc, double lookSign, double a[3]) {
  if (int st = orbit.updatePolys(t); st != 0) return st;
  const double* pos = orbit.getCurPos();
  if (!pos) {
    ORV_REPORT("No orbit state vectors around the scene centre", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  return getgeopoly(t, swstMin, samples, frg, pos, orbit.getCurT0(), orbit.dt, fc, &dc, lookSign, 3, a,
                    nullptr, nullptr);
}

}  // namespace

int geometricRatePoly(GeneralSAROrbit& orbit, double tStart, double tEnd, double swstMin, int samples,
                      double frg, double fc, const polyDC& dc, double lookSign, polyFR& fr) {
  const double tMid = 0.5 * (tStart + tEnd);
  double mid[3] = {0, 0, 0}, first[3] = {0, 0, 0}, last[3] = {0, 0, 0};
  int st = rangeFit(orbit, tMid, swstMin, samples, frg, fc, dc, lookSign, mid);
  if (st == 0 && tEnd > tStart) st = rangeFit(orbit, tStart, swstMin, samples, frg, fc, dc, lookSign, first);
  if (st == 0 && tEnd > tStart) st = rangeFit(orbit, tEnd, swstMin, samples, frg, fc, dc, lookSign, last);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  for (double& c : fr.c) c = 0.0;
  fr.c[0] = mid[0];
  fr.c[1] = mid[1];
  fr.c[4] = mid[2];
  if (tEnd > tStart) {
    fr.c[2] = (last[0] - first[0]) / (tEnd - tStart);
    fr.c[3] = (last[1] - first[1]) / (tEnd - tStart);
  }
  fr.trg0 = swstMin;
  fr.taz0 = tMid;
  // Leave the orbit's window where the scene centre needs it.
  return orbit.updatePolys(tMid);
}
