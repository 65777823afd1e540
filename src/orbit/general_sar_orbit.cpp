#include "orbit/general_sar_orbit.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <new>

#include "base/constants.h"
#include "base/status.h"
#include "diag/report.h"
#include "numerics/fitting.h"
#include "orbit/ground_geometry.h"
#include "orbit/orbit_files.h"
#include "product/poly_sar.h"
#include "product/profile.h"
#include "product/roi.h"

namespace {

constexpr double kA = consts::kWgs84A;
constexpr double kB = consts::kWgs84B;
constexpr double kC = consts::kSpeedOfLight;

double vdot(const double* a, const double* b) { return a[0] * b[0] + a[1] * b[1] + a[2] * b[2]; }
double vnorm(const double* a) { return std::sqrt(vdot(a, a)); }
void unit3(const double* a, double* out) {
  const double n = vnorm(a);
  for (int k = 0; k < 3; ++k) out[k] = n > 0.0 ? a[k] / n : 0.0;
}
void cross3(const double* a, const double* b, double* out) {
  out[0] = a[1] * b[2] - a[2] * b[1];
  out[1] = a[2] * b[0] - a[0] * b[2];
  out[2] = a[0] * b[1] - a[1] * b[0];
}
int roundAway(double x) { return static_cast<int>(x >= 0.0 ? std::floor(x + 0.5) : std::ceil(x - 0.5)); }

// q = transpose(m) d, with m stored row by row.
void transposeMul(const double m[9], const double d[3], double q[3]) {
  for (int j = 0; j < 3; ++j) q[j] = m[j] * d[0] + m[3 + j] * d[1] + m[6 + j] * d[2];
}

// Along-track time offset of the straight-line model for Doppler fd.
double lineTime(const double q[3], double fd, double lambda, double speed) {
  if (fd == 0.0) return q[0] / speed;
  const double k = (fd * lambda / 2.0) * (fd * lambda / 2.0) / (speed * speed);
  const double B = (k - 1.0) * q[0];
  const double q2 = vdot(q, q);
  return (std::sqrt(B * B - (q[0] * q[0] - k * q2) * (1.0 - k)) - B) / (1.0 - k) / speed;
}

}  // namespace

// ---- life ------------------------------------------------------------------------

GeneralSAROrbit::GeneralSAROrbit() { createElementsVector(5); }

GeneralSAROrbit::GeneralSAROrbit(double lambdaValue) : lambda(lambdaValue) { createElementsVector(5); }

GeneralSAROrbit::~GeneralSAROrbit() { destroyBuffers(); }

void GeneralSAROrbit::refreshParameters() {
  addElementDouble("pSV_m", pos.empty() ? nullptr : pos.data(), 3 * nSV, -1.0e12, 1.0e12, true);
  addElementDouble("vSV_mOs", vel.empty() ? nullptr : vel.data(), 3 * nSV, -1.0e12, 1.0e12, true);
  addElementDouble("t0SV_s", &t0, 1, -1.0e12, 1.0e12, true);
  addElementDouble("dtSV_s", &dt, 1, -1.0e12, 1.0e12, true);
  addElementInt("nSV_n", &nSV, 1, 0, 2147483647, true);
}

int GeneralSAROrbit::createBuffers() {
  if (nSV == 0) return STATUS_OK;
  if (nSV < 0) {
    ORV_REPORT("Negative number of state vectors", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  destroyBuffers();
  try {
    pos.assign(3 * static_cast<std::size_t>(nSV), 0.0);
    vel.assign(3 * static_cast<std::size_t>(nSV), 0.0);
    refreshParameters();
    nWindows = nSV >= 5 ? nSV - 4 : 0;
    polyX.assign(5 * static_cast<std::size_t>(nWindows), 0.0);
    polyY.assign(5 * static_cast<std::size_t>(nWindows), 0.0);
    polyZ.assign(5 * static_cast<std::size_t>(nWindows), 0.0);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory for the state vectors", REPORT_ERROR);
    destroyBuffers();
    return STATUS_NO_MEMORY;
  }
  setAllocationFlag(true);
  return STATUS_OK;
}

int GeneralSAROrbit::destroyBuffers() {
  pos.clear();
  vel.clear();
  polyX.clear();
  polyY.clear();
  polyZ.clear();
  pos.shrink_to_fit();
  vel.shrink_to_fit();
  nWindows = 0;
  clearModels();
  refreshParameters();
  setAllocationFlag(false);
  return STATUS_OK;
}

void GeneralSAROrbit::clearModels() {
  curWindow = -1;
  curT0 = 0.0;
}

int GeneralSAROrbit::SVCreate(double t0Value, double dtValue, int n) {
  SVDestroy();
  if (n < 5) {
    ORV_REPORT("You must provide at least 5 state vectors!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  t0 = t0Value;
  dt = dtValue;
  nSV = n;
  return createBuffers();
}

int GeneralSAROrbit::SVDestroy() {
  if (!pos.empty()) destroyBuffers();
  return STATUS_OK;
}

// ---- models ----------------------------------------------------------------------

int GeneralSAROrbit::computeRotationMatrix(const double v[3], double m[9], double* speed) {
  const double s = v[0] / std::fabs(v[0]);
  const double a = std::atan(-v[1] / v[0]);
  const double b = std::atan(-v[2] / (s * std::sqrt(v[0] * v[0] + v[1] * v[1])));
  const double ca = std::cos(a), sa = std::sin(a), cb = std::cos(b), sb = std::sin(b);
  m[0] = ca * cb;
  m[1] = sa;
  m[2] = sb * ca;
  m[3] = -sa * cb;
  m[4] = ca;
  m[5] = -sa * sb;
  m[6] = -sb;
  m[7] = 0.0;
  m[8] = cb;
  *speed = s * vnorm(v);
  return STATUS_OK;
}

int GeneralSAROrbit::computeApproximateSV() {
  if (pos.empty() || nSV < 5) {
    ORV_REPORT("No state vectors to model", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  for (int i = 0; i < nWindows; ++i) {
    int st = orb_interp(0.0, &pos[3 * static_cast<std::size_t>(i)], dt, &polyX[5 * i], &polyY[5 * i],
                        &polyZ[5 * i], 5);
    if (st != 0) {
      ORV_REPORT_CALLED_ERROR();
      return st;
    }
  }
  clearModels();
  coarseDt = (nSV - 1) * dt / 4.0;
  coarseT0 = t0;
  for (int k = 0; k < 5; ++k) {
    SVGetPos(coarseT0 + k * coarseDt, coarsePos + 3 * k);
    SVGetVel(coarseT0 + k * coarseDt, coarseVel + 3 * k);
  }
  int st = orb_interp(0.0, coarsePos, coarseDt, coarsePolyX, coarsePolyY, coarsePolyZ, 5);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  double mean[3];
  const std::size_t last = 3 * static_cast<std::size_t>(nSV - 1);
  for (int k = 0; k < 3; ++k) mean[k] = (pos[last + k] - pos[k]) / ((nSV - 1) * dt);
  computeRotationMatrix(mean, approxRotation, &approxSpeed);
  return STATUS_OK;
}

int GeneralSAROrbit::updatePolys(double t) {
  if (nWindows < 1) return STATUS_BAD_CONDITION;
  const double d = std::fabs(t - curT0);
  if (curWindow >= 0 && d >= 0.6 * dt && d <= 3.4 * dt && t >= curT0) return STATUS_OK;
  return getCurrentSV(t);
}

int GeneralSAROrbit::getCurrentSV(double t) {
  if (nWindows < 1) return STATUS_BAD_CONDITION;
  const double d = t - t0;
  int i;
  if (d >= 0.0 && d <= (nSV - 1) * dt) {
    const double e = std::fabs(t - curT0);
    if (e < 0.6 * dt)
      i = static_cast<int>(std::ceil((d + 0.6 * dt) / dt)) - 4;
    else
      i = static_cast<int>(std::floor((d - 0.6 * dt) / dt));
    if (i < 0) i = 0;
    if (i > nSV - 5) i = nSV - 5;
  } else if (d >= 0.0) {
    i = nSV - 5;
  } else {
    i = 0;
  }
  curWindow = i;
  curT0 = t0 + i * dt;
  return STATUS_OK;
}

// ---- platform state -------------------------------------------------------------------

int GeneralSAROrbit::SVGetPos(double t, double out[3]) {
  if (pos.empty() || updatePolys(t) != 0) return STATUS_BAD_CONDITION;
  const double u = t - curT0;
  out[0] = POSMACRO(u, &polyX[5 * curWindow], 5);
  out[1] = POSMACRO(u, &polyY[5 * curWindow], 5);
  out[2] = POSMACRO(u, &polyZ[5 * curWindow], 5);
  return STATUS_OK;
}

int GeneralSAROrbit::SVGetVel(double t, double out[3]) {
  if (pos.empty() || updatePolys(t) != 0) return STATUS_BAD_CONDITION;
  const double u = t - curT0;
  out[0] = VELMACRO(u, &polyX[5 * curWindow], 5);
  out[1] = VELMACRO(u, &polyY[5 * curWindow], 5);
  out[2] = VELMACRO(u, &polyZ[5 * curWindow], 5);
  return STATUS_OK;
}

double* GeneralSAROrbit::SVGetPos(double t) {
  SVGetPos(t, scratchXYZ);
  return scratchXYZ;
}

double* GeneralSAROrbit::SVGetVel(double t) {
  SVGetVel(t, scratchXYZ);
  return scratchXYZ;
}

bool GeneralSAROrbit::isAscending() const { return vel.size() >= 3 && vel[2] > 0.0; }

int GeneralSAROrbit::clone(GeneralSAROrbit* dst) const {
  dst->SVDestroy();
  int st = dst->SVCreate(t0, dt, nSV);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  dst->lambda = lambda;
  dst->lookSign = lookSign;
  dst->pos = pos;
  dst->vel = vel;
  dst->refreshParameters();
  st = dst->computeApproximateSV();
  if (st != 0) ORV_REPORT_CALLED_ERROR();
  return st;
}

// ---- forward solutions ---------------------------------------------------------------------

int GeneralSAROrbit::sat2earth(const double p[3], const double v[3], double tau, double out[3]) {
  double g[3];
  if (gr_pt(g, p, v, tau, 0.0, lambda, 0.0, static_cast<double>(lookSign), kA, kB) == 0)
    std::memcpy(out, g, sizeof g);
  return STATUS_OK;
}

int GeneralSAROrbit::sat2earth(double t, double tau, double out[3]) { return sat2earth(t, tau, 0.0, out); }

int GeneralSAROrbit::sat2earth(double t, double tau, double fd, double out[3]) {
  double p[3], v[3], g[3];
  updatePolys(t);
  if (SVGetPos(t, p) != 0 || SVGetVel(t, v) != 0) return STATUS_OK;
  if (gr_pt(g, p, v, tau, fd, lambda, 0.0, static_cast<double>(lookSign), kA, kB) == 0)
    std::memcpy(out, g, sizeof g);
  return STATUS_OK;
}

double* GeneralSAROrbit::sat2earth(double t, double tau) {
  sat2earth(t, tau, 0.0, scratchXYZ);
  return scratchXYZ;
}

double* GeneralSAROrbit::sat2earth(double t, double tau, double fd) {
  sat2earth(t, tau, fd, scratchXYZ);
  return scratchXYZ;
}

int GeneralSAROrbit::sat2earthSquinted(double t, double tau, double fd, double out[3], double* tauOut) {
  double G[3] = {0, 0, 0}, S[3], V[3];
  sat2earth(t, tau, G);
  if (SVGetPos(t, S) != 0 || SVGetVel(t, V) != 0) return STATUS_BAD_CONDITION;
  double d[3], r[3], v[3], n[3];
  for (int k = 0; k < 3; ++k) d[k] = G[k] - S[k];
  unit3(d, r);
  unit3(V, v);
  cross3(r, v, n);
  const double D = V[1] - V[0] * n[1] / n[0];
  const double p = -lambda * fd / (2.0 * D);
  const double w = (V[2] - V[0] * n[2] / n[0]) / D;
  const double g = -(n[1] / n[0]) * p;
  const double h = (n[1] / n[0]) * w - n[2] / n[0];
  const double A = h * h + w * w + 1.0;
  const double B = 2.0 * h * g - 2.0 * w * p;
  const double C = p * p + g * g - 1.0;
  const double disc = std::sqrt(B * B - 4.0 * A * C);
  auto intersect = [&](double uz, double u[3]) {
    u[0] = h * uz + g;
    u[1] = p - w * uz;
    u[2] = uz;
    const double a2 = 40680631590769.0, b2 = 40408299984659.16;
    const double A2 = (u[0] * u[0] + u[1] * u[1]) / a2 + u[2] * u[2] / b2;
    const double B2 = -(2.0 * S[0] * u[0] + 2.0 * S[1] * u[1]) / a2 - 2.0 * S[2] * u[2] / b2;
    const double C2 = (S[0] * S[0] + S[1] * S[1]) / a2 + S[2] * S[2] / b2 - 1.0;
    return (-B2 - std::sqrt(B2 * B2 - 4.0 * A2 * C2)) / (2.0 * A2);
  };
  double u[3];
  double rho = intersect((disc - B) / (2.0 * A), u);
  if (rho < 0.0) rho = intersect((-B - disc) / (2.0 * A), u);
  *tauOut = 2.0 * rho / kC;
  for (int k = 0; k < 3; ++k) out[k] = S[k] - rho * u[k];
  return STATUS_OK;
}

int GeneralSAROrbit::recordQuery(double t, double tau, double fd, double h, grPtRecord* rec) {
  if (pos.empty()) return STATUS_BAD_CONDITION;
  int st = updatePolys(t);
  if (st != 0) return st;
  std::memset(rec, 0, sizeof *rec);
  std::memcpy(rec->pos, &pos[3 * static_cast<std::size_t>(curWindow)], 15 * sizeof(double));
  rec->t0 = curT0;
  rec->dt = dt;
  rec->t = t;
  rec->tau = tau;
  rec->fd = fd;
  rec->lambda = lambda;
  rec->lookSign = static_cast<double>(lookSign);
  rec->height = h;
  return gr_pt_lat_lon(rec, kA, kB);
}

double GeneralSAROrbit::sat2earthX(double t, double tau) { return sat2earthX(t, tau, 0.0); }
double GeneralSAROrbit::sat2earthY(double t, double tau) { return sat2earthY(t, tau, 0.0); }
double GeneralSAROrbit::sat2earthZ(double t, double tau) { return sat2earthZ(t, tau, 0.0); }

double GeneralSAROrbit::sat2earthX(double t, double tau, double h) {
  if (pos.empty() || updatePolys(t) != 0) return 0.0;
  grPtRecord rec;
  int st = recordQuery(t, tau, 0.0, h, &rec);
  return st != 0 ? static_cast<double>(st) : rec.x;
}
double GeneralSAROrbit::sat2earthY(double t, double tau, double h) {
  if (pos.empty() || updatePolys(t) != 0) return 0.0;
  grPtRecord rec;
  int st = recordQuery(t, tau, 0.0, h, &rec);
  return st != 0 ? static_cast<double>(st) : rec.y;
}
double GeneralSAROrbit::sat2earthZ(double t, double tau, double h) {
  if (pos.empty() || updatePolys(t) != 0) return 0.0;
  grPtRecord rec;
  int st = recordQuery(t, tau, 0.0, h, &rec);
  return st != 0 ? static_cast<double>(st) : rec.z;
}

int GeneralSAROrbit::SVGetLatLon(double t, double tau, double fd, double* lat, double* lon) {
  grPtRecord rec;
  int st = recordQuery(t, tau, fd, 0.0, &rec);
  if (st != 0) return st;
  *lat = rec.lat;
  *lon = rec.lon;
  return STATUS_OK;
}

int GeneralSAROrbit::SVGetLatLon(double t, double tau, double* lat, double* lon) {
  int st = SVGetLatLon(t, tau, 0.0, lat, lon);
  if (st != 0) st = SVGetLatLon(t, tau, 0.0, lat, lon);
  return st;
}

int GeneralSAROrbit::SVGetAngles(double t, double tau, double fd, double* inc, double* look) {
  grPtRecord rec;
  int st = recordQuery(t, tau, fd, 0.0, &rec);
  if (st != 0) return st;
  *inc = rec.incidence;
  *look = rec.look;
  return STATUS_OK;
}

int GeneralSAROrbit::SVGetAngles(double t, double tau, double* inc, double* look) {
  int st = SVGetAngles(t, tau, 0.0, inc, look);
  if (st != 0) st = SVGetAngles(t, tau, 0.0, inc, look);
  return st;
}

int GeneralSAROrbit::SVGetFR(double t, double tau, double fd, double* fr) {
  if (pos.empty()) return STATUS_BAD_CONDITION;
  grPtRecord rec;
  int st = recordQuery(t, tau, fd, 0.0, &rec);
  if (st != 0) return st;
  *fr = rec.fmRate;
  return STATUS_OK;
}

int GeneralSAROrbit::SVGetSatSpeed(double t, double tau, double fd, double* speed) {
  if (pos.empty()) return STATUS_BAD_CONDITION;
  grPtRecord rec;
  int st = recordQuery(t, tau, fd, 0.0, &rec);
  if (st != 0) return st;
  *speed = rec.groundSpeed;
  return STATUS_OK;
}

double GeneralSAROrbit::SVGetLat(double t, double tau) {
  double lat = 0.0, lon = 0.0;
  SVGetLatLon(t, tau, &lat, &lon);
  return lat;
}
double GeneralSAROrbit::SVGetLon(double t, double tau) {
  double lat = 0.0, lon = 0.0;
  SVGetLatLon(t, tau, &lat, &lon);
  return lon;
}
double GeneralSAROrbit::SVGetAnglesIncidence(double t, double tau) {
  double inc = 0.0, look = 0.0;
  SVGetAngles(t, tau, &inc, &look);
  return inc;
}
double GeneralSAROrbit::SVGetAnglesLook(double t, double tau) {
  double inc = 0.0, look = 0.0;
  SVGetAngles(t, tau, &inc, &look);
  return look;
}

// ---- inverse solutions ---------------------------------------------------------------------

int GeneralSAROrbit::earth2satLinear(const double P[3], double* t, double* tau, double fd) {
  if (pos.empty() || nSV < 5) return STATUS_BAD_CONDITION;
  double d[3], q[3];
  for (int k = 0; k < 3; ++k) d[k] = P[k] - pos[k];
  transposeMul(approxRotation, d, q);
  double u = lineTime(q, fd, lambda, approxSpeed);
  // Window index, clamped in floating point first so that a degenerate
  // table (no motion: not-a-number) cannot overflow the conversion.
  const double ui = std::isfinite(u / dt) ? std::clamp(u / dt, -1e9, 1e9) : 0.0;
  int i = roundAway(ui) - 2;
  if (i < 1) i = 0;
  if (i > nSV - 5) i = nSV - 5;
  const std::size_t o = 3 * static_cast<std::size_t>(i);
  double mean[3], m[9], speed;
  for (int k = 0; k < 3; ++k) mean[k] = (pos[o + 12 + k] - pos[o + k]) / (4.0 * dt);
  computeRotationMatrix(mean, m, &speed);
  for (int k = 0; k < 3; ++k) d[k] = P[k] - pos[o + k];
  transposeMul(m, d, q);
  u = fd == 0.0 ? q[0] / speed : lineTime(q, fd, lambda, approxSpeed);
  const double e[3] = {q[0] - u * approxSpeed, q[1], q[2]};
  *tau = 2.0 * vnorm(e) / kC;
  *t = i * dt + t0 + u;
  return STATUS_OK;
}

int GeneralSAROrbit::earth2satLinear(const double P[3], double* t, double* tau) {
  return earth2satLinear(P, t, tau, 0.0);
}

int GeneralSAROrbit::earth2sat(const double P[3], double* t, double* tau, double fd) {
  if (pos.empty()) {
    *t = -1.0;
    *tau = -1.0;
    return STATUS_BAD_CONDITION;
  }
  double tg, taug;
  earth2satLinear(P, &tg, &taug, fd);
  updatePolys(tg);
  double u, tauK;
  if (inv_grpt_opt(&u, &tauK, &polyX[5 * curWindow], &polyY[5 * curWindow], &polyZ[5 * curWindow], P,
                   4.0 * dt, lambda, fd) != 0)
    return 12;
  *t = u + curT0;
  *tau = tauK;
  return STATUS_OK;
}

int GeneralSAROrbit::earth2sat(const double P[3], double* t, double* tau) {
  return earth2sat(P, t, tau, 0.0);
}

int GeneralSAROrbit::earth2satPrecise(const double P[3], double* t, double* tau, double fd) {
  double u, tauK;
  if (inv_grpt_opt(&u, &tauK, coarsePolyX, coarsePolyY, coarsePolyZ, P, 4.0 * coarseDt, lambda, fd) !=
      0)
    return 12;
  updatePolys(u + coarseT0);
  if (curWindow < 0) return 12;
  if (inv_grpt_opt(&u, &tauK, &polyX[5 * curWindow], &polyY[5 * curWindow], &polyZ[5 * curWindow], P,
                   4.0 * dt, lambda, fd) != 0)
    return 12;
  *t = u + curT0;
  *tau = tauK;
  return STATUS_OK;
}

int GeneralSAROrbit::earth2satPrecise(const double P[3], double* t, double* tau) {
  return earth2satPrecise(P, t, tau, 0.0);
}

double GeneralSAROrbit::earth2satRange(const double xyz[3]) {
  double t = 0.0, tau = 0.0;
  earth2sat(xyz, &t, &tau);
  return tau;
}

double GeneralSAROrbit::earth2satAzimuth(const double xyz[3]) {
  double t = 0.0, tau = 0.0;
  earth2sat(xyz, &t, &tau);
  return t;
}

double GeneralSAROrbit::earth2satRange(double lat, double lon, double h) {
  const double deg = consts::kPi / 180.0;
  const double llh[3] = {lat * deg, lon * deg, h};
  double xyz[3];
  llh2xyz(xyz, llh, kA, kB);
  return earth2satRange(xyz);
}

double GeneralSAROrbit::earth2satAzimuth(double lat, double lon, double h) {
  const double deg = consts::kPi / 180.0;
  const double llh[3] = {lat * deg, lon * deg, h};
  double xyz[3];
  llh2xyz(xyz, llh, kA, kB);
  return earth2satAzimuth(xyz);
}

// ---- Doppler rate polynomials -------------------------------------------------------------------

int GeneralSAROrbit::SVGetFRpoly(const ROI_Obj* roi, const polyDC* dc, polyFR* fr) {
  const double r0 = roi->FastStartTime;
  const double tm = roi->SlowStartTime + roi->SlowTimeLength / 2.0;
  const double step = roi->FastTimeLength / 9.0;
  double x[10], y[10];
  for (int i = 0; i < 10; ++i) {
    x[i] = i * step;
    const double tau = x[i] + r0;
    const double fd = dc->EvaluatePoly(tau, tm);
    int st = SVGetFR(tm, tau, fd, &y[i]);
    if (st != 0) {
      ORV_REPORT_CALLED_ERROR();
      return st;
    }
  }
  double a[3];
  int st = polfit(x, y, 10, a, 2);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  for (double& c : fr->c) c = 0.0;
  fr->c[0] = a[0];
  fr->c[1] = a[1];
  fr->c[4] = a[2];
  fr->trg0 = r0;
  fr->taz0 = 0.0;
  return STATUS_OK;
}

int GeneralSAROrbit::SVGetFRpoly_v2(const ROI_Obj* roi, const polyDC* dc, polyFR* fr) {
  const double r0 = roi->FastStartTime;
  const double tm = roi->SlowStartTime + roi->SlowTimeLength / 2.0;
  const double step = roi->FastTimeLength / 49.0;
  double x[50], y[50];
  for (int i = 0; i < 50; ++i) {
    const double tau = r0 + i * step;
    x[i] = tau - dc->trg0;
    const double fd = dc->EvaluatePoly(tau, tm);
    int st = SVGetFR(tm, tau, fd, &y[i]);
    if (st != 0) {
      ORV_REPORT_CALLED_ERROR();
      return st;
    }
  }
  double a[3];
  int st = polfit(x, y, 50, a, 2);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  for (double& c : fr->c) c = 0.0;
  fr->c[0] = a[0];
  fr->c[1] = a[1];
  fr->c[4] = a[2];
  fr->trg0 = dc->trg0;
  fr->taz0 = 0.0;
  return STATUS_OK;
}

// ---- header files ------------------------------------------------------------------------

int GeneralSAROrbit::writehdr(const std::string& file) {
  refreshParameters();
  writeAuxiliaryFile(file, 1, "StateVectorData");
  return STATUS_OK;
}

int GeneralSAROrbit::readhdr(const std::string& file) {
  if (readAuxiliaryFile(file, 1, "StateVectorData") && !pos.empty()) {
    int st = computeApproximateSV();
    if (st != 0) ORV_REPORT_CALLED_ERROR();
    return st;
  }
  const char* section = "StateVectorData";
  std::vector<double> first(1), delta(1);
  std::vector<int> count(1);
  if (GetProfileDoubleArray(section, "TimeFirst", first, 1, file) != 0 ||
      GetProfileDoubleArray(section, "TimeDelta", delta, 1, file) != 0 ||
      GetMyProfileIntArray(section, "nStateVectors", count, 1, file) != 0) {
    // No orbit in this file: a normal case of a partial product record.
    return STATUS_READ_FAILED;
  }
  int st = SVCreate(first[0], delta[0], count[0]);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  if (GetProfileDoubleArray(section, "pos", pos.data(), 3 * nSV, file) != 0 ||
      GetProfileDoubleArray(section, "vel", vel.data(), 3 * nSV, file) != 0) {
    ORV_REPORT("State vector keys missing in " + file, REPORT_ERROR);
    return STATUS_READ_FAILED;
  }
  st = computeApproximateSV();
  if (st != 0) ORV_REPORT_CALLED_ERROR();
  return st;
}

// ---- interferometric baseline -----------------------------------------------------------

int GeneralSARInterf::getBaseline(double t, double tau) {
  double S1[3], V1[3], G[3] = {0, 0, 0}, G2[3] = {0, 0, 0}, S2[3];
  SVGetPos(t, S1);
  SVGetVel(t, V1);
  sat2earth(t, tau, G);
  double t2, tau2;
  if (slave.earth2sat(G, &t2, &tau2) != 0) return STATUS_BAD_CONDITION;
  slave.SVGetPos(t2, S2);
  sat2earth(t, tau + 5e-6, G2);
  double d[3], l[3], w[3], h[3], n[3], B[3];
  for (int k = 0; k < 3; ++k) d[k] = G[k] - S1[k];
  unit3(d, l);
  for (int k = 0; k < 3; ++k) d[k] = G2[k] - S1[k];
  const double ld = vdot(l, d);
  for (int k = 0; k < 3; ++k) w[k] = d[k] - l[k] * ld;
  unit3(w, h);
  cross3(l, h, n);
  for (int k = 0; k < 3; ++k) B[k] = S2[k] - S1[k];
  Bl = vdot(B, l);
  Bh = vdot(B, h);
  Bn = vdot(B, n);
  slaveT = t2;
  slaveTau = tau2;
  std::memcpy(masterPos, S1, sizeof S1);
  std::memcpy(slavePos, S2, sizeof S2);
  std::memcpy(groundPoint, G, sizeof G);
  return STATUS_OK;
}
