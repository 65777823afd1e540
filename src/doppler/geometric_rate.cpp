// Doppler rate polynomial of a scene from its orbit, with its drift along
// the scene: the rates that leave a point at the phase and the line of its
// closest approach once the focusing kernel has read its hyperbola off them.
#include "doppler/geometric_rate.h"

#include <cmath>

#include "base/constants.h"
#include "base/status.h"
#include "diag/report.h"
#include "orbit/general_sar_orbit.h"
#include "orbit/geo_grid.h"
#include "orbit/ground_geometry.h"
#include "product/poly_sar.h"

namespace {

constexpr int kPoints = 10;
constexpr int kTerms = 4;  // cubic in fast time

// Below this centroid (Hz) the beam centre and the closest approach are too
// close for their ranges to tell a rate: the orbit's local rate stands
// there (the two agree to parts in 1e7).
constexpr double kMinCentroid = 1.0;

// Quartic through the five state vectors of the orbit's current window:
// one smooth curve for both ends of a range history (the windows of the
// orbit need not join to the millimetre, and a millimetre is 13 degrees).
struct WindowOrbit {
  double cx[5], cy[5], cz[5];
  double t0 = 0.0;
  void at(double t, double p[3], double v[3], double a[3]) const {
    POSVELACC_5(t - t0, cx, cy, cz, p, v, a);
  }
};

double dot(const double a[3], const double b[3]) { return a[0] * b[0] + a[1] * b[1] + a[2] * b[2]; }

// Range history of the fixed point P seen at time t: its Doppler, and the
// depth of its range migration (range at t less the closest range).
struct Migration {
  double v = 0.0;      // lambda fd / 2, m/s
  double depth = 0.0;  // m
  double rate = 0.0;   // Hz/s, of the hyperbola with that Doppler and depth
};

// False where the centroid is too small to give a depth.
bool migrationOf(const WindowOrbit& o, double t, const double P[3], double lambda, Migration& m) {
  double S[3], V[3], A[3];
  o.at(t, S, V, A);
  const double D[3] = {S[0] - P[0], S[1] - P[1], S[2] - P[2]};
  const double Rc = std::sqrt(dot(D, D));
  const double fd = -2.0 / lambda * dot(D, V) / Rc;
  if (std::fabs(fd) < kMinCentroid) return false;
  // Closest approach: (S(t0) - P) . V(t0) = 0 by Newton steps.
  double t0 = t;
  for (int it = 0; it < 50; ++it) {
    o.at(t0, S, V, A);
    const double E[3] = {S[0] - P[0], S[1] - P[1], S[2] - P[2]};
    const double step = dot(E, V) / (dot(V, V) + dot(E, A));
    t0 -= step;
    if (std::fabs(step) < 1e-12) break;
  }
  o.at(t0, S, V, A);
  const double E[3] = {S[0] - P[0], S[1] - P[1], S[2] - P[2]};
  const double R0 = std::sqrt(dot(E, E));
  const double squares = (Rc - R0) * (Rc + R0);
  if (!(squares > 0.0)) return false;
  m.v = lambda * fd / 2.0;
  m.depth = Rc - R0;
  // Hyperbola through both ranges with the Doppler fd at Rc: cos(squint) =
  // R0 / Rc, rate -2 (V cos)^2 / (lambda Rc) with V sin = v.
  m.rate = -lambda * fd * fd * R0 * R0 / (2.0 * Rc * squares);
  return true;
}

// Rates of kPoints points across the swath at azimuth t, fitted by a cubic
// in fast time from swstMin (a[0..3]). The point of a sample lies at the
// two-way delay peakDelay seconds before the sample's time.
int rangeFit(GeneralSAROrbit& orbit, double t, double swstMin, double peakDelay, int samples, double frg,
             double fc, const polyDC& dc, double lookSign, double a[kTerms]) {
  if (int st = orbit.updatePolys(t); st != 0) return st;
  const double* pos = orbit.getCurPos();
  if (!pos) {
    ORV_REPORT("No orbit state vectors around the scene centre", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  const double dtau = samples / frg / (kPoints - 1);
  double fr[kPoints];
  Migration mig[kPoints];
  bool squinted[kPoints];
  int st = get_geo_grid(t, swstMin - peakDelay, 1, kPoints, 0.0, dtau, fr, nullptr, nullptr, pos, orbit.getCurT0(),
                        orbit.dt, fc, &dc, lookSign);
  WindowOrbit o;
  o.t0 = orbit.getCurT0();
  if (st == 0) st = orb_interp(0.0, pos, orbit.dt, o.cx, o.cy, o.cz, 5);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  const double lambda = consts::kSpeedOfLight / fc;
  double S[3], V[3], A[3];
  o.at(t, S, V, A);
  for (int i = 0; i < kPoints; ++i) {
    const double tau = swstMin + i * dtau;
    double P[3];
    squinted[i] = gr_pt(P, S, V, tau - peakDelay, DCeval(&dc, tau, t), lambda, 0.0, lookSign, consts::kWgs84A,
                        consts::kWgs84B) == 0 &&
                  migrationOf(o, t, P, lambda, mig[i]);
    // An orbit's range history is not quite a hyperbola: its local rate at
    // the beam centre (fr[i]) and the rate of the hyperbola through the
    // closest range differ by a few 1e-6 at three PRFs of centroid.
    if (squinted[i]) fr[i] = mig[i].rate;
  }
  st = get_poly(fr, nullptr, nullptr, 1, kPoints, dtau, kTerms, a, nullptr, nullptr);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  // The focusing kernel reads a hyperbola off the rate polynomial: its
  // curvature from the rate, and a speed and a range from the rate's
  // change across the swath (1 / rate = -lambda R / (2 W), W = V^2 - v^2).
  // An orbit's W falls across the swath (by some 2e-3 over an ERS swath,
  // R W' / W about -0.045), so the kernel's W and range both come out some
  // 4 % off, their ratio right. The squint v / sqrt(W + v^2) that it then
  // gives the hyperbola misses the depth of the range migration by those
  // 4 % times the squared squint: 1.4e-5 at three PRFs, -30 degrees of
  // phase and a tenth of a line, growing with the fourth power of the
  // centroid. Each rate is scaled so that the kernel's hyperbola has the
  // depth of the point's range history; the kernel's range stays.
  const double halfC = consts::kSpeedOfLight / 2.0;
  for (int i = 0; i < kPoints; ++i) {
    if (!squinted[i]) continue;
    const double x = i * dtau;
    const double f = a[0] + x * (a[1] + x * (a[2] + x * a[3]));
    const double df = (a[1] + x * (2.0 * a[2] + x * 3.0 * a[3])) / halfC;  // per metre
    if (!(f < 0.0 && df > 0.0)) continue;
    const double kernelRange = -f / df;                   // beam-centre range of the kernel
    const double kernelW = lambda * f * f / (2.0 * df);  // V^2 - v^2 of the kernel
    const double cs = 1.0 - mig[i].depth / kernelRange;  // squint of that depth
    if (!(cs > 0.0 && cs < 1.0)) continue;
    const double W = mig[i].v * mig[i].v * cs * cs / ((1.0 - cs) * (1.0 + cs));
    fr[i] = f * W / kernelW;
  }
  st = get_poly(fr, nullptr, nullptr, 1, kPoints, dtau, kTerms, a, nullptr, nullptr);
  if (st != 0) ORV_REPORT_CALLED_ERROR();
  return st;
}

}  // namespace

int geometricRatePoly(GeneralSAROrbit& orbit, double tStart, double tEnd, double swstMin, double peakDelay,
                      int samples, double frg, double fc, const polyDC& dc, double lookSign, polyFR& fr) {
  const double tMid = 0.5 * (tStart + tEnd);
  double mid[kTerms] = {}, first[kTerms] = {}, last[kTerms] = {};
  int st = rangeFit(orbit, tMid, swstMin, peakDelay, samples, frg, fc, dc, lookSign, mid);
  if (st == 0 && tEnd > tStart)
    st = rangeFit(orbit, tStart, swstMin, peakDelay, samples, frg, fc, dc, lookSign, first);
  if (st == 0 && tEnd > tStart)
    st = rangeFit(orbit, tEnd, swstMin, peakDelay, samples, frg, fc, dc, lookSign, last);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  for (double& c : fr.c) c = 0.0;
  fr.c[0] = mid[0];
  fr.c[1] = mid[1];
  fr.c[4] = mid[2];
  fr.c[5] = mid[3];
  if (tEnd > tStart) {
    fr.c[2] = (last[0] - first[0]) / (tEnd - tStart);
    fr.c[3] = (last[1] - first[1]) / (tEnd - tStart);
  }
  fr.trg0 = swstMin;
  fr.taz0 = tMid;
  // Leave the orbit's window where the scene centre needs it.
  return orbit.updatePolys(tMid);
}

double compressedPeakDelay(double pulseLength, int replicaSamples, double frg) {
  if (!(frg > 0.0) || !(pulseLength > 0.0) || replicaSamples < 1) return 0.0;
  const double offset = (frg * pulseLength - (replicaSamples - 1)) / 2.0;  // samples
  return std::fabs(offset) <= 2.0 ? offset / frg : 0.0;
}
