#include "orbit/geo_grid.h"

#include <cmath>
#include <cstring>
#include <vector>

#include "base/constants.h"
#include "base/status.h"
#include "diag/report.h"
#include "numerics/fitting.h"
#include "orbit/general_sar_orbit.h"
#include "orbit/ground_geometry.h"
#include "product/general_sar.h"
#include "product/geo_coords.h"
#include "product/poly_sar.h"
#include "product/roi.h"

namespace {

constexpr double kDeg = consts::kPi / 180.0;

double distance(const double* a, const double* b) {
  return std::sqrt((a[0] - b[0]) * (a[0] - b[0]) + (a[1] - b[1]) * (a[1] - b[1]) +
                   (a[2] - b[2]) * (a[2] - b[2]));
}

// Stores a0 + a1 x + a2 x^2 as c0, c1, c4 of a row.
void storeQuadratic(poly* p, const double a[3], double trg0, double taz0) {
  for (double& c : p->c) c = 0.0;
  p->c[0] = a[0];
  p->c[1] = a[1];
  p->c[4] = a[2];
  p->trg0 = trg0;
  p->taz0 = taz0;
}

int fitQuadratic(const double* x, const double* y, int n, poly* p, double trg0, double taz0) {
  double a[3];
  int st = polfit(x, y, n, a, 2);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  storeQuadratic(p, a, trg0, taz0);
  return STATUS_OK;
}

// Basis 1, u, v, u v, u^2, u^3, u^4 of the region grids.
void gridBasis(double u, double v, NrVector<double>& f) {
  f[1] = 1.0;
  f[2] = u;
  f[3] = v;
  f[4] = u * v;
  f[5] = u * u;
  f[6] = u * u * u;
  f[7] = u * u * u * u;
}

constexpr int kGridAz = 50;
constexpr int kGridRg = 100;

// Seven-term fit of values over the 50 x 100 grid numbered n = 100 j + i,
// rescaled to range offset (step dr) and azimuth offset (step da).
int fitGrid(const std::vector<double>& values, double dr, double da, poly* p, double trg0,
            double taz0) {
  const int ndat = kGridAz * kGridRg;
  NrVector<double> x(1, ndat), y(1, ndat), sig(1, ndat, 1.0), a(1, 7, 0.0);
  NrVector<int> ia(1, 7, 1);
  NrMatrix<double> covar(1, 7, 1, 7);
  for (int n = 0; n < ndat; ++n) {
    x[n + 1] = n;
    y[n + 1] = values[static_cast<std::size_t>(n)];
  }
  double chisq = 0.0;
  int st = lfitd(x, y, sig, ndat, a, ia, 7, covar, &chisq, [](double xn, NrVector<double>& f, int) {
    const double u = std::fmod(xn, static_cast<double>(kGridRg));
    const double v = std::floor(xn / kGridRg);
    gridBasis(u, v, f);
  });
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  p->c[0] = a[1];
  p->c[1] = a[2] / dr;
  p->c[2] = a[3] / da;
  p->c[3] = a[4] / (da * dr);
  p->c[4] = a[5] / (dr * dr);
  p->c[5] = a[6] / (dr * dr * dr);
  p->c[6] = a[7] / (dr * dr * dr * dr);
  p->trg0 = trg0;
  p->taz0 = taz0;
  return STATUS_OK;
}

}  // namespace

double DCeval(const polyDC* dc, double tau, double t) { return dc ? dc->EvaluatePoly(tau, t) : 0.0; }

// ---- corners -------------------------------------------------------------------------

int GeneralSAROrbit::SVGetGeoCoords(geoCoords_Obj* geo, GSRoi_Obj* roi) {
  return SVGetGeoCoords(geo, &roi->roi);
}

int GeneralSAROrbit::SVGetGeoCoords(geoCoords_Obj* geo, const ROI_Obj* roi) {
  const double r0 = roi->FastStartTime, a0 = roi->SlowStartTime;
  const double R = roi->FastTimeLength, A = roi->SlowTimeLength;
  struct Corner {
    double t, tau;
    geopoint* slot;
  };
  const bool asc = isAscending();
  const Corner corners[5] = {
      {asc ? a0 + A : a0, asc ? r0 : r0 + R, &geo->NW},
      {asc ? a0 + A : a0, asc ? r0 + R : r0, &geo->NE},
      {asc ? a0 : a0 + A, asc ? r0 : r0 + R, &geo->SW},
      {asc ? a0 : a0 + A, asc ? r0 + R : r0, &geo->SE},
      {a0 + A / 2.0, r0 + R / 2.0, &geo->center},
  };
  for (const Corner& c : corners) {
    double lat, lon, inc, look;
    int st = SVGetLatLon(c.t, c.tau, &lat, &lon);
    if (st == 0) st = SVGetAngles(c.t, c.tau, &inc, &look);
    if (st != 0) {
      ORV_REPORT_CALLED_ERROR();
      return st;
    }
    c.slot->set(lat, lon, 0.0, inc, look);
  }
  return STATUS_OK;
}

// ---- mid-azimuth polynomials ------------------------------------------------------------------

int GeneralSAROrbit::SVGetSlantToAnglesPolys(const ROI_Obj* roi, const polyDC* dc,
                                             polySL2THETA* theta, polySL2PHI* phi) {
  const double r0 = roi->FastStartTime;
  const double tm = roi->SlowStartTime + roi->SlowTimeLength / 2.0;
  const double step = roi->FastTimeLength / 9.0;
  double x[10], yTheta[10], yPhi[10];
  for (int i = 0; i < 10; ++i) {
    x[i] = i * step;
    const double tau = r0 + i * step;
    double inc, look;
    int st = SVGetAngles(tm, tau, DCeval(dc, tau, tm), &inc, &look);
    if (st != 0) {
      ORV_REPORT_CALLED_ERROR();
      return st;
    }
    yPhi[i] = std::sin(inc * kDeg);
    yTheta[i] = look * kDeg;
  }
  if (phi && fitQuadratic(x, yPhi, 10, phi, r0, 0.0) != 0) return STATUS_BAD_CONDITION;
  if (theta && fitQuadratic(x, yTheta, 10, theta, r0, 0.0) != 0) return STATUS_BAD_CONDITION;
  return STATUS_OK;
}

int GeneralSAROrbit::SVGetGroundToSlantPolys(const ROI_Obj* roi, const polyDC* dc, polySL2GR* sl2gr,
                                             polyGR2SL* gr2sl) {
  const double r0 = roi->FastStartTime;
  const double tm = roi->SlowStartTime + roi->SlowTimeLength / 2.0;
  const double step = roi->FastTimeLength / 9.0;
  double x[10], gr[10], prev[3] = {0, 0, 0};
  for (int i = 0; i < 10; ++i) {
    x[i] = i * step;
    const double tau = r0 + i * step;
    double g[3] = {0, 0, 0};
    sat2earth(tm, tau, DCeval(dc, tau, tm), g);
    gr[i] = i == 0 ? 0.0 : gr[i - 1] + distance(g, prev);
    std::memcpy(prev, g, sizeof g);
  }
  if (sl2gr && fitQuadratic(x, gr, 10, sl2gr, r0, 0.0) != 0) return STATUS_BAD_CONDITION;
  if (gr2sl && fitQuadratic(gr, x, 10, gr2sl, r0, 0.0) != 0) return STATUS_BAD_CONDITION;
  return STATUS_OK;
}

// ---- whole-region polynomials -------------------------------------------------------------------

int GeneralSAROrbit::SVGetGroundToTimePolys(const ROI_Obj* roi, const polyDC* dc, polySL2GR* sl2gr,
                                            polyGR2SL* gr2sl) {
  const double r0 = roi->FastStartTime, a0 = roi->SlowStartTime;
  const double dr = roi->FastTimeLength / (kGridRg - 1);
  const double da = roi->SlowTimeLength / (kGridAz - 1);
  const int ndat = kGridAz * kGridRg;
  std::vector<double> gr(ndat);
  for (int j = 0; j < kGridAz; ++j) {
    const double t = a0 + j * da;
    double prev[3] = {0, 0, 0};
    for (int i = 0; i < kGridRg; ++i) {
      const double tau = r0 + i * dr;
      double g[3] = {0, 0, 0};
      sat2earth(t, tau, DCeval(dc, tau, t), g);
      const int n = kGridRg * j + i;
      gr[n] = i == 0 ? 0.0 : gr[n - 1] + distance(g, prev);
      std::memcpy(prev, g, sizeof g);
    }
  }
  if (sl2gr && fitGrid(gr, dr, da, sl2gr, r0, a0) != 0) return STATUS_BAD_CONDITION;
  if (gr2sl) {
    // Slant time against ground range (metres) and azimuth offset; the
    // azimuth reference is folded into the coefficients so that both
    // references are 0.
    NrVector<double> y(1, ndat), sig(1, ndat, 1.0), a(1, 7, 0.0);
    NrVector<int> ia(1, 7, 1);
    NrMatrix<double> covar(1, 7, 1, 7);
    for (int n = 0; n < ndat; ++n) y[n + 1] = (n % kGridRg) * dr;
    double chisq = 0.0;
    int st = lfit_mod(y, sig, ndat, a, ia, 7, covar, &chisq, [&](int i, NrVector<double>& f, int) {
      gridBasis(gr[static_cast<std::size_t>(i - 1)], static_cast<double>((i - 1) / kGridRg), f);
    });
    if (st != 0) {
      ORV_REPORT_CALLED_ERROR();
      return st;
    }
    // v = (az - a0) / da.
    gr2sl->c[0] = a[1] + r0 - a[3] * a0 / da;
    gr2sl->c[1] = a[2] - a[4] * a0 / da;
    gr2sl->c[2] = a[3] / da;
    gr2sl->c[3] = a[4] / da;
    gr2sl->c[4] = a[5];
    gr2sl->c[5] = a[6];
    gr2sl->c[6] = a[7];
    gr2sl->trg0 = 0.0;
    gr2sl->taz0 = 0.0;
  }
  return STATUS_OK;
}

int GeneralSAROrbit::SVGetTimeToAnglesPolys(const ROI_Obj* roi, const polyDC* dc,
                                            polySL2THETA* theta, polySL2PHI* phi) {
  const double r0 = roi->FastStartTime, a0 = roi->SlowStartTime;
  const double dr = roi->FastTimeLength / (kGridRg - 1);
  const double da = roi->SlowTimeLength / (kGridAz - 1);
  std::vector<double> vTheta(kGridAz * kGridRg), vPhi(kGridAz * kGridRg);
  for (int j = 0; j < kGridAz; ++j) {
    const double t = a0 + j * da;
    for (int i = 0; i < kGridRg; ++i) {
      const double tau = r0 + i * dr;
      double inc, look;
      int st = SVGetAngles(t, tau, DCeval(dc, tau, t), &inc, &look);
      if (st != 0) {
        ORV_REPORT_CALLED_ERROR();
        return st;
      }
      vPhi[kGridRg * j + i] = std::sin(inc * kDeg);
      vTheta[kGridRg * j + i] = look * kDeg;
    }
  }
  if (phi && fitGrid(vPhi, dr, da, phi, r0, a0) != 0) return STATUS_BAD_CONDITION;
  if (theta && fitGrid(vTheta, dr, da, theta, r0, a0) != 0) return STATUS_BAD_CONDITION;
  return STATUS_OK;
}

// ---- grids without the orbit object ---------------------------------------------------------------

int get_geo_grid(double t0, double tau0, int ny, int nx, double dt, double dtau, double* outFr,
                 double* outInc, double* outLook, const double pos[15], double svT0, double svDt,
                 double fc, const polyDC* dc, double lookSign) {
  if (ny < 1 || nx < 1 || fc <= 0.0) {
    ORV_REPORT("Bad grid size or carrier frequency", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  for (int j = 0; j < ny; ++j) {
    for (int i = 0; i < nx; ++i) {
      grPtRecord rec;
      std::memset(&rec, 0, sizeof rec);
      std::memcpy(rec.pos, pos, 15 * sizeof(double));
      rec.t0 = svT0;
      rec.dt = svDt;
      rec.t = t0 + j * dt;
      rec.tau = tau0 + i * dtau;
      rec.fd = DCeval(dc, rec.tau, rec.t);
      rec.lambda = consts::kSpeedOfLight / fc;
      rec.lookSign = lookSign;
      rec.height = 0.0;
      int st = gr_pt_lat_lon(&rec, consts::kWgs84A, consts::kWgs84B);
      if (st != 0) {
        ORV_REPORT_CALLED_ERROR();
        return st;
      }
      const int k = j * nx + i;
      if (outFr) outFr[k] = rec.fmRate;
      if (outInc) outInc[k] = rec.incidence;
      if (outLook) outLook[k] = rec.look;
    }
  }
  return STATUS_OK;
}

int get_poly(const double* fr, const double* inc, const double* look, int ny, int nx, double dtau,
             int nTerms, double* frPoly, double* incPoly, double* lookPoly) {
  if (nTerms < 1 || nTerms > 4 || nx < nTerms || ny < 1) {
    ORV_REPORT("Bad number of polynomial terms", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  const int row = ny / 2;
  std::vector<double> x(nx);
  for (int i = 0; i < nx; ++i) x[i] = i * dtau;
  const double* values[3] = {fr, inc, look};
  double* outs[3] = {frPoly, incPoly, lookPoly};
  for (int q = 0; q < 3; ++q) {
    if (!values[q] || !outs[q]) continue;
    int st = polfit(x.data(), values[q] + static_cast<std::size_t>(row) * nx, nx, outs[q], nTerms - 1);
    if (st != 0) {
      ORV_REPORT_CALLED_ERROR();
      return st;
    }
  }
  return STATUS_OK;
}

int getgeopoly(double t, double tau0, int nSamples, double fs, const double pos[15], double svT0,
               double svDt, double fc, const polyDC* dc, double lookSign, int nTerms,
               double* frPoly, double* incPoly, double* lookPoly) {
  if (fs <= 0.0 || nSamples < 1) {
    ORV_REPORT("Bad sampling rate or sample count", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  constexpr int kPoints = 10;
  const double dtau = nSamples / fs / (kPoints - 1);
  double fr[kPoints], inc[kPoints], look[kPoints];
  int st = get_geo_grid(t, tau0, 1, kPoints, 0.0, dtau, fr, inc, look, pos, svT0, svDt, fc, dc,
                        lookSign);
  if (st == 0) st = get_poly(fr, inc, look, 1, kPoints, dtau, nTerms, frPoly, incPoly, lookPoly);
  if (st != 0) ORV_REPORT_CALLED_ERROR();
  return st;
}
