#include "orbit/ground_geometry.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <vector>

#include "base/constants.h"
#include "base/status.h"
#include "diag/report.h"
#include "numerics/fitting.h"

namespace {

constexpr double kRadToDeg = 180.0 / consts::kPi;
constexpr double kInitialStep2 = 3.4028234663852886e38;  // largest float
constexpr int kInverseFailed = 12;

void sub3(const double a[3], const double b[3], double out[3]) {
  out[0] = a[0] - b[0];
  out[1] = a[1] - b[1];
  out[2] = a[2] - b[2];
}

double clampUnit(double v) { return std::max(-1.0, std::min(1.0, v)); }

}  // namespace

// ---------------------------------------------------------------------------
// Small vector kernels

double dot3(const double a[3], const double b[3]) { return a[0] * b[0] + a[1] * b[1] + a[2] * b[2]; }

double norm3(const double a[3]) { return std::sqrt(dot3(a, a)); }

void make_versor(const double v[3], double out[3]) {
  const double n = norm3(v);
  if (n == 0.0) {
    out[0] = out[1] = out[2] = 0.0;
    return;
  }
  out[0] = v[0] / n;
  out[1] = v[1] / n;
  out[2] = v[2] / n;
}

void v1pv2(const double a[3], const double b[3], double out[3]) {
  out[0] = a[1] * b[2] - a[2] * b[1];
  out[1] = a[2] * b[0] - a[0] * b[2];
  out[2] = a[0] * b[1] - a[1] * b[0];
}

double determ(const double m[9]) {
  return m[0] * (m[4] * m[8] - m[5] * m[7]) - m[1] * (m[3] * m[8] - m[5] * m[6]) +
         m[2] * (m[3] * m[7] - m[4] * m[6]);
}

int inv3x3(const double m[9], double out[9]) {
  const double d = determ(m);
  if (d == 0.0) return STATUS_BAD_CONDITION;
  const double inv = 1.0 / d;
  out[0] = (m[4] * m[8] - m[5] * m[7]) * inv;
  out[1] = (m[2] * m[7] - m[1] * m[8]) * inv;
  out[2] = (m[1] * m[5] - m[2] * m[4]) * inv;
  out[3] = (m[5] * m[6] - m[3] * m[8]) * inv;
  out[4] = (m[0] * m[8] - m[2] * m[6]) * inv;
  out[5] = (m[2] * m[3] - m[0] * m[5]) * inv;
  out[6] = (m[3] * m[7] - m[4] * m[6]) * inv;
  out[7] = (m[1] * m[6] - m[0] * m[7]) * inv;
  out[8] = (m[0] * m[4] - m[1] * m[3]) * inv;
  return STATUS_OK;
}

void mul3x3(const double a[9], const double b[9], double out[9]) { mul(a, b, out, 3, 3, 3); }

void mul3x1(const double m[9], const double v[3], double out[3]) { mul_NxM_M(m, v, out, 3, 3); }

void mul(const double* a, const double* b, double* out, int n, int m, int p) {
  for (int i = 0; i < n; ++i)
    for (int j = 0; j < p; ++j) {
      double s = 0.0;
      for (int k = 0; k < m; ++k) s += a[i * m + k] * b[k * p + j];
      out[i * p + j] = s;
    }
}

void mul_NxM_M(const double* a, const double* v, double* out, int n, int m) {
  for (int i = 0; i < n; ++i) {
    double s = 0.0;
    for (int k = 0; k < m; ++k) s += a[i * m + k] * v[k];
    out[i] = s;
  }
}

void tran(const double* a, double* out, int n, int m) {
  for (int i = 0; i < n; ++i)
    for (int j = 0; j < m; ++j) out[j * n + i] = a[i * m + j];
}

double COS_PHI_V(const double a[3], const double b[3]) {
  const double na = norm3(a), nb = norm3(b);
  if (na == 0.0 || nb == 0.0) return 0.0;
  const double c = dot3(a, b) / (na * nb);
  if (c > 1.0 || c < -1.0) return 1.0;
  return c;
}

double fdc_interp(double x, double x0, const double c[3]) {
  const double d = x - x0;
  return c[0] * d * d + c[1] * d + c[2];
}

// ---------------------------------------------------------------------------
// Orbit polynomials (highest power first)

double POSMACRO(double u, const double* c, int n) {
  double s = 0.0, p = 1.0;
  for (int k = 0; k < n; ++k) {
    s += c[n - 1 - k] * p;
    p *= u;
  }
  return s;
}

double VELMACRO(double u, const double* c, int n) {
  double s = 0.0, p = 1.0;
  for (int k = 1; k < n; ++k) {
    s += k * c[n - 1 - k] * p;
    p *= u;
  }
  return s;
}

double ACCMACRO(double u, const double* c, int n) {
  double s = 0.0, p = 1.0;
  for (int k = 2; k < n; ++k) {
    s += k * (k - 1) * c[n - 1 - k] * p;
    p *= u;
  }
  return s;
}

double pos(double u, const double* c, int n) {
  if (n < 1) return 0.0;
  double s = 0.0;
  for (int k = 0; k < n; ++k) s += c[n - 1 - k] * std::pow(u, k);
  return s;
}

double vel(double u, const double* c, int n) {
  if (n < 2) return 0.0;
  double s = 0.0;
  for (int k = 1; k < n; ++k) s += k * c[n - 1 - k] * std::pow(u, k - 1);
  return s;
}

double acc(double u, const double* c, int n) {
  if (n < 3) return 0.0;
  double s = 0.0;
  for (int k = 2; k < n; ++k) s += k * (k - 1) * c[n - 1 - k] * std::pow(u, k - 2);
  return s;
}

void POSVELACC_5(double u, const double* cx, const double* cy, const double* cz, double p[3],
                 double v[3], double a[3]) {
  const double u2 = u * u, u3 = u2 * u, u4 = u3 * u;
  const double* c[3] = {cx, cy, cz};
  for (int k = 0; k < 3; ++k) {
    p[k] = c[k][0] * u4 + c[k][1] * u3 + c[k][2] * u2 + c[k][3] * u + c[k][4];
    v[k] = 4.0 * c[k][0] * u3 + 3.0 * c[k][1] * u2 + 2.0 * c[k][2] * u + c[k][3];
    a[k] = 12.0 * c[k][0] * u2 + 6.0 * c[k][1] * u + 2.0 * c[k][2];
  }
}

int orb_interp(double t0, const double* pts, double dt, double* cx, double* cy, double* cz, int n) {
  const int status = orbffit(t0, dt, pts, n, cx, cy, cz);
  if (status != STATUS_OK) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  std::reverse(cx, cx + n);
  std::reverse(cy, cy + n);
  std::reverse(cz, cz + n);
  return STATUS_OK;
}

// ---------------------------------------------------------------------------
// Forward solution

int gr_pt0(double out[3], const double S[3], const double V[3], double tau, double /*lambda*/,
           double omega, double lookSign, double a, double b) {
  const double rho = consts::kSpeedOfLight * tau / 2.0;
  const double p2 = S[0] * S[0] + S[1] * S[1];
  const double p = std::sqrt(p2);
  const double sNorm = norm3(S);
  const double th = (p > 0.0) ? std::acos(clampUnit(p2 / (sNorm * p))) : consts::kPi / 2.0;
  const double ca = a * std::cos(th), sb = b * std::sin(th);
  const double rl2 = ca * ca + sb * sb;

  // Velocity relative to the rotating Earth.
  const double Vr[3] = {V[0] + omega * S[1], V[1] - omega * S[0], V[2]};
  const double d1 = (sNorm * sNorm + rl2 - rho * rho) / 2.0;
  const double d2 = dot3(S, V);

  const double c1 = S[2] * Vr[1] - S[1] * V[2];
  const double c2 = S[2] * Vr[0] - S[0] * V[2];
  const double c3 = S[1] * Vr[0] - S[0] * Vr[1];
  int freeAxis;
  double pivot;
  if (std::fabs(c1) >= std::fabs(c2) && std::fabs(c1) > std::fabs(c3)) {
    freeAxis = 0;
    pivot = c1;
  } else if (std::fabs(c1) < std::fabs(c2) && std::fabs(c3) < std::fabs(c2)) {
    freeAxis = 1;
    pivot = c2;
  } else {
    freeAxis = 2;
    pivot = c3;
  }
  if (std::fabs(pivot) < 1e-21) return STATUS_BAD_CONDITION;

  // The two planes give the other coordinates linearly in the free one:
  // X_i = pi + qi s, X_j = pj + qj s.
  const int i = (freeAxis == 0) ? 1 : 0;
  const int j = (freeAxis == 2) ? 1 : 2;
  const int f = freeAxis;
  const double det = S[i] * Vr[j] - S[j] * Vr[i];
  const double pi = (d1 * Vr[j] - S[j] * d2) / det;
  const double qi = (S[j] * Vr[f] - S[f] * Vr[j]) / det;
  const double pj = (S[i] * d2 - Vr[i] * d1) / det;
  const double qj = (Vr[i] * S[f] - S[i] * Vr[f]) / det;

  // |X|^2 = Rl^2: A s^2 + 2 B s + D = 0.
  const double A = 1.0 + qi * qi + qj * qj;
  const double B = pi * qi + pj * qj;
  const double D = pi * pi + pj * pj - rl2;
  const double disc = B * B - A * D;
  if (disc < 0.0) return 2;
  const double sq = std::sqrt(disc);

  auto place = [&](double s) {
    out[f] = s;
    out[i] = pi + qi * s;
    out[j] = pj + qj * s;
  };
  place((sq - B) / A);

  // Side test: w = unit(S) x unit(V without its component along S).
  double sHat[3], vPerp[3], vHat[3], w[3];
  make_versor(S, sHat);
  const double along = dot3(V, sHat);
  for (int k = 0; k < 3; ++k) vPerp[k] = V[k] - along * sHat[k];
  make_versor(vPerp, vHat);
  v1pv2(sHat, vHat, w);
  if (dot3(out, w) * lookSign > 0.0) place((-B - sq) / A);
  return STATUS_OK;
}

int gr_pt(double out[3], const double S[3], const double V[3], double tau, double fd, double lambda,
          double omega, double lookSign, double a, double b) {
  double X[3];
  const int status = gr_pt0(X, S, V, tau, lambda, omega, lookSign, a, b);
  if (status != STATUS_OK) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  const double rho = consts::kSpeedOfLight * tau / 2.0;
  const double a2 = a * a, b2 = b * b;
  const double k = 2.0 / lambda;
  double e0 = kInitialStep2;
  for (int round = 0; round < 20; ++round) {
    double R[3];
    sub3(S, X, R);
    const double r = norm3(R);
    const double W[3] = {V[0] + omega * X[1], V[1] - omega * X[0], V[2]};
    const double wr = dot3(W, R);
    const double F[3] = {r * r - rho * rho,
                         (X[0] * X[0] + X[1] * X[1]) / a2 + X[2] * X[2] / b2 - 1.0,
                         k * wr / r + fd};
    const double r3 = r * r * r;
    const double J[9] = {-2.0 * R[0], -2.0 * R[1], -2.0 * R[2],
                         2.0 * X[0] / a2, 2.0 * X[1] / a2, 2.0 * X[2] / b2,
                         k * (R[0] * wr / r3 - W[0] / r), k * (R[1] * wr / r3 - W[1] / r),
                         k * (R[2] * wr / r3 - W[2] / r)};
    // Cramer's rule for J d = -F.
    const double det = determ(J);
    double d[3];
    for (int c = 0; c < 3; ++c) {
      double M[9];
      std::copy(J, J + 9, M);
      for (int row = 0; row < 3; ++row) M[3 * row + c] = -F[row];
      d[c] = determ(M) / det;
    }
    X[0] += d[0];
    X[1] += d[1];
    X[2] += d[2];
    const double e = dot3(d, d);
    if (e <= 1e-10) break;
    if (e0 / e <= 2.0) break;
    e0 = e;
  }
  out[0] = X[0];
  out[1] = X[1];
  out[2] = X[2];
  return STATUS_OK;
}

// ---------------------------------------------------------------------------
// Inverse solution

namespace {

// Newton in time on the Doppler condition. rounds: the round limit; tol: the
// stop on the change in u (negative: none); speak: a line on stderr when
// the iterate leaves the span.
int inverseNewton(double* t, double* tau, const double* cx, const double* cy, const double* cz,
                  int n, const double P[3], double tMax, double lambda, double fd, int rounds,
                  double tol, bool speak) {
  const double w = consts::kEarthRotation;
  double u = tMax / 2.0;
  const double Vt[3] = {-w * P[1], w * P[0], 0.0};
  const double h = lambda * fd / 2.0;
  double tauK = 0.0;
  for (int round = 0; round < rounds; ++round) {
    if (!(u >= 0.0 && u <= tMax)) {  // also stops on a not-a-number iterate
      if (speak)
        std::fprintf(stderr, "inv_grpt: azimuth time %g s outside the orbit span 0 .. %g s\n", u,
                     tMax);
      return kInverseFailed;
    }
    double p[3], v[3], acc3[3];
    if (n == 5) {
      POSVELACC_5(u, cx, cy, cz, p, v, acc3);
    } else {
      p[0] = POSMACRO(u, cx, n), p[1] = POSMACRO(u, cy, n), p[2] = POSMACRO(u, cz, n);
      v[0] = VELMACRO(u, cx, n), v[1] = VELMACRO(u, cy, n), v[2] = VELMACRO(u, cz, n);
      acc3[0] = ACCMACRO(u, cx, n), acc3[1] = ACCMACRO(u, cy, n), acc3[2] = ACCMACRO(u, cz, n);
    }
    const double vr[3] = {v[0] - w * p[1], v[1] + w * p[0], v[2]};
    double R[3];
    sub3(P, p, R);
    const double r = norm3(R);
    tauK = 2.0 * r / consts::kSpeedOfLight;
    const double D[3] = {Vt[0] - vr[0], Vt[1] - vr[1], Vt[2] - vr[2]};
    const double f = dot3(D, R) + h * r;
    const double fp = -dot3(D, vr) - dot3(R, acc3) - dot3(vr, R) * h / r;
    const double du = f / fp;
    u -= du;
    if (tol >= 0.0 && std::fabs(du) <= tol) break;
  }
  *t = u;
  *tau = tauK;
  return STATUS_OK;
}

}  // namespace

int inv_grpt_opt(double* t, double* tau, const double* cx, const double* cy, const double* cz,
                 const double P[3], double tMax, double lambda, double fd) {
  return inverseNewton(t, tau, cx, cy, cz, 5, P, tMax, lambda, fd, 8, 1e-8, false);
}

int inv_grpt_opt_NSV(double* t, double* tau, const double* cx, const double* cy, const double* cz,
                     const double P[3], double tMax, double lambda, double fd, int n) {
  return inverseNewton(t, tau, cx, cy, cz, n, P, tMax, lambda, fd, 8, 1e-8, false);
}

int inv_grpt_NSV(double* t, double* tau, const double* pts, const double P[3], double dt,
                 double lambda, double fd, int n) {
  std::vector<double> cx(n), cy(n), cz(n);
  const int status = orb_interp(0.0, pts, dt, cx.data(), cy.data(), cz.data(), n);
  if (status != STATUS_OK) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  return inverseNewton(t, tau, cx.data(), cy.data(), cz.data(), n, P, (n - 1) * dt, lambda, fd, 8,
                       -1.0, true);
}

int inv_grpt(double* t, double* tau, const double* pts, const double P[3], double dt, double lambda,
             double fd) {
  return inv_grpt_NSV(t, tau, pts, P, dt, lambda, fd, 5);
}

// ---------------------------------------------------------------------------
// Everything about a ground point

namespace {

void clearOutputs(grPtRecord* rec) {
  rec->x = rec->y = rec->z = 0.0;
  rec->lat = rec->lon = 0.0;
  rec->trackHeading = rec->incidence = rec->look = 0.0;
  rec->groundSpeed = rec->beamSpeed = rec->fmRate = 0.0;
}

// Steps shared by both explicit-vector forms; A null means no Doppler rate.
int groundPointProperties(grPtRecord* rec, const double S[3], const double V[3], const double* A,
                          double a, double b) {
  const double w = consts::kEarthRotation;
  const double Vi[3] = {V[0] - w * S[1], V[1] + w * S[0], V[2]};
  double X[3];
  int status = gr_pt(X, S, Vi, rec->tau, rec->fd, rec->lambda, w, rec->lookSign, a, b);
  if (status != STATUS_OK) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  const double rt = norm3(X) + rec->height;
  double ea = a, eb = b;
  if (rec->height != 0.0) {
    const double k = a / b;
    ea = std::sqrt(rt * rt + (k * k - 1.0) * X[2] * X[2]);
    eb = std::sqrt(ea * ea / (k * k));
    status = gr_pt(X, S, Vi, rec->tau, rec->fd, rec->lambda, w, rec->lookSign, ea, eb);
    if (status != STATUS_OK) {
      ORV_REPORT_CALLED_ERROR();
      return status;
    }
  }
  rec->x = X[0];
  rec->y = X[1];
  rec->z = X[2];

  // Track heading from the direction of the inertial velocity in the tangent plane.
  double n[3], g[3], e[3], m[3];
  const double nRaw[3] = {2.0 * X[0] / kWgs84A2, 2.0 * X[1] / kWgs84A2, 2.0 * X[2] / kWgs84B2};
  make_versor(nRaw, n);
  const double nv = dot3(n, Vi);
  const double gRaw[3] = {Vi[0] - n[0] * nv, Vi[1] - n[1] * nv, Vi[2] - n[2] * nv};
  make_versor(gRaw, g);
  if (X[1] != 0.0) {
    const double xy = X[0] / X[1];
    const double en = std::sqrt(1.0 + xy * xy);
    e[0] = 1.0 / en;
    e[1] = -xy / en;
  } else {  // limit of the same vector for y -> 0+
    e[0] = 0.0;
    e[1] = (X[0] > 0.0) ? -1.0 : 1.0;
  }
  e[2] = 0.0;
  const double ge = dot3(g, e);
  const double mRaw[3] = {g[0] - e[0] * ge, g[1] - e[1] * ge, g[2] - e[2] * ge};
  make_versor(mRaw, m);
  if (m[2] < 0.0) {
    m[0] = -m[0];
    m[1] = -m[1];
    m[2] = -m[2];
  }
  const double s = (ge < 0.0) ? -1.0 : 1.0;
  rec->trackHeading = s * std::acos(clampUnit(dot3(g, m))) * kRadToDeg;

  double latlon[2];
  xyz2geo(X, latlon, ea, eb);
  rec->lat = latlon[0] * kRadToDeg;
  rec->lon = latlon[1] * kRadToDeg;

  double D[3], dHat[3], xHat[3], sHat[3];
  sub3(S, X, D);
  make_versor(D, dHat);
  make_versor(X, xHat);
  make_versor(S, sHat);
  rec->incidence = std::acos(clampUnit(dot3(dHat, xHat))) * kRadToDeg;
  rec->look = std::acos(clampUnit(dot3(dHat, sHat))) * kRadToDeg;

  const double vNorm = norm3(V);
  if (A != nullptr) {
    double vh[3], ah[3], bn[3], cn[3];
    make_versor(V, vh);
    make_versor(A, ah);
    const double rc = vNorm * vNorm / norm3(A);
    v1pv2(vh, ah, bn);
    v1pv2(vh, bn, cn);
    const double r = norm3(D);
    const double sn = std::cos(consts::kPi / 2.0 - std::acos(clampUnit(dot3(D, vh) / r)));
    const double rp = sn * r;
    const double f = std::cos(std::atan2(dot3(D, bn), dot3(D, cn)));
    rec->fmRate = sn * sn * sn * (1.0 - f * (rp / rc) / (sn * sn)) * vNorm * vNorm *
                  (-2.0 / rec->lambda) / rp;
  }
  rec->groundSpeed = vNorm * rt / norm3(S);
  return STATUS_OK;
}

}  // namespace

int gr_pt_lat_lon_s_osculated(grPtRecord* rec, const double S[3], const double V[3],
                              const double A[3], double a, double b) {
  const int status = groundPointProperties(rec, S, V, A, a, b);
  if (status != STATUS_OK) ORV_REPORT_CALLED_ERROR();
  return status;
}

int gr_pt_lat_lon_s(grPtRecord* rec, const double S[3], const double V[3], double a, double b) {
  const int status = groundPointProperties(rec, S, V, nullptr, a, b);
  if (status != STATUS_OK) ORV_REPORT_CALLED_ERROR();
  return status;
}

int gr_pt_lat_lon(grPtRecord* rec, double a, double b) {
  clearOutputs(rec);
  double cx[5], cy[5], cz[5];
  int status = orb_interp(0.0, rec->pos, rec->dt, cx, cy, cz, 5);
  if (status != STATUS_OK) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  const double u = rec->t - rec->t0;
  if (u < -rec->dt / 2.0 || u > 4.0 * rec->dt + rec->dt / 2.0) return -1;
  const double S[3] = {pos(u, cx, 5), pos(u, cy, 5), pos(u, cz, 5)};
  const double V[3] = {vel(u, cx, 5), vel(u, cy, 5), vel(u, cz, 5)};
  const double A[3] = {acc(u, cx, 5), acc(u, cy, 5), acc(u, cz, 5)};
  status = gr_pt_lat_lon_s_osculated(rec, S, V, A, a, b);
  if (status != STATUS_OK) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  // Curvature radius from the second-order coefficients, i.e. the
  // acceleration at the first vector of the window.
  const double q2[3] = {2.0 * cx[2], 2.0 * cy[2], 2.0 * cz[2]};
  const double vNorm = norm3(V);
  const double rc = vNorm * vNorm / norm3(q2);
  rec->beamSpeed =
      (1.0 - (consts::kSpeedOfLight * rec->tau / 2.0) * std::cos(rec->look / kRadToDeg) / rc) *
      vNorm;
  return STATUS_OK;
}

// ---------------------------------------------------------------------------
// Coordinate conversions

void xyz2geo(const double xyz[3], double latlon[2], double a, double b) {
  const double x = xyz[0], y = xyz[1], z = xyz[2];
  const double p = std::sqrt(x * x + y * y);
  const double th = std::atan(z * a / (p * b));
  const double ct = std::cos(th), st = std::sin(th);
  // The fixed equatorial radius (not a) is part of the formula.
  double d = p - ct * ct * ct * (1.0 - b * b / (a * a)) * consts::kWgs84A;
  if (p == 0.0) d = 0.0;  // polar axis
  if (d == 0.0)
    latlon[0] = (z > 0.0) ? consts::kPi / 2.0 : -consts::kPi / 2.0;
  else
    latlon[0] = std::atan((z + st * st * st * (a * a / (b * b) - 1.0) * b) / d);
  latlon[1] = std::atan2(y, x);
}

void xyz2llh(const double xyz[3], double llh[3], double a, double b) {
  const double x = xyz[0], y = xyz[1], z = xyz[2];
  const double p = std::sqrt(x * x + y * y);
  const double th = std::atan(z * a / (p * b));
  const double ct = std::cos(th), st = std::sin(th);
  const double e2 = 1.0 - b * b / (a * a);
  double d = p - ct * ct * ct * e2 * a;
  if (p == 0.0) d = 0.0;
  double lat;
  if (d == 0.0)
    lat = (z > 0.0) ? consts::kPi / 2.0 : -consts::kPi / 2.0;
  else
    lat = std::atan((z + st * st * st * (a * a / (b * b) - 1.0) * b) / d);
  const double sl = std::sin(lat), cl = std::cos(lat);
  // p / cos(lat) - N written so that it stays exact towards the poles.
  const double h = p * cl + z * sl - a * std::sqrt(1.0 - e2 * sl * sl);
  llh[0] = lat;
  llh[1] = std::atan2(y, x);
  llh[2] = h;
}

void geo2cart(double xyz[3], const double llh[3]) {
  const double e2 = 0.006739496742276434;
  const double lat = llh[0], lon = llh[1], h = llh[2];
  const double cl = std::cos(lat);
  const double N = consts::kWgs84A * std::sqrt(1.0067394967422765) / std::sqrt(1.0 + e2 * cl * cl);
  xyz[0] = (N + h) * cl * std::cos(lon);
  xyz[1] = (N + h) * cl * std::sin(lon);
  xyz[2] = (0.9933056200098587 * N + h) * std::sin(lat);
}

void llh2xyz(double xyz[3], const double llh[3], double a, double b) {
  const double f = (a - b) / a;
  const double e2 = f * (2.0 - f) / ((1.0 - f) * (1.0 - f));
  const double lat = llh[0], lon = llh[1], h = llh[2];
  const double cl = std::cos(lat);
  const double N = a * std::sqrt(1.0 + e2) / std::sqrt(1.0 + e2 * cl * cl);
  xyz[0] = (N + h) * cl * std::cos(lon);
  xyz[1] = (N + h) * cl * std::sin(lon);
  xyz[2] = ((1.0 - f) * (1.0 - f) * N + h) * std::sin(lat);
}

// ---------------------------------------------------------------------------
// Orbit angles and baseline

int Otrulat(const double S[3], const double V[3], double* out) {
  const double mu = kEarthGM;
  const double r[3] = {S[0] / 1000.0, S[1] / 1000.0, S[2] / 1000.0};
  const double v[3] = {V[0] / 1000.0, V[1] / 1000.0, V[2] / 1000.0};
  const double rn = norm3(r);
  const double v2 = dot3(v, v);
  const double rv = dot3(r, v);
  const double sma = 1.0 / (2.0 / rn - v2 / mu);
  double hvec[3];
  v1pv2(r, v, hvec);
  const double evec[3] = {((v2 - mu / rn) * r[0] - rv * v[0]) / mu,
                          ((v2 - mu / rn) * r[1] - rv * v[1]) / mu,
                          ((v2 - mu / rn) * r[2] - rv * v[2]) / mu};
  const double ecc = norm3(evec);
  // Argument of perigee from the ascending node direction k x h.
  const double node[3] = {-hvec[1], hvec[0], 0.0};
  double hHat[3], nHat[3], across[3];
  make_versor(hvec, hHat);
  make_versor(node, nHat);
  v1pv2(hHat, nHat, across);
  const double argPerigee = std::atan2(dot3(evec, across), dot3(evec, nHat));
  // Eccentric and mean anomaly, then Kepler's equation back to the true anomaly.
  const double eCosE = 1.0 - rn / sma;
  const double eSinE = rv / std::sqrt(mu * sma);
  const double E0 = std::atan2(eSinE, eCosE);
  const double M = E0 - eSinE;
  double E = M;
  for (int k = 0; k < 100; ++k) {
    const double dE = (E - ecc * std::sin(E) - M) / (1.0 - ecc * std::cos(E));
    E -= dE;
    if (std::fabs(dE) < 1e-11) break;
  }
  const double nu = 2.0 * std::atan2(std::sqrt(1.0 + ecc) * std::sin(E / 2.0),
                                     std::sqrt(1.0 - ecc) * std::cos(E / 2.0));
  *out = std::atan2(std::sin(nu + argPerigee), std::cos(nu + argPerigee));
  return STATUS_OK;
}

double compute_ulat(const double S[3], double t, const double nodes[6], double t0) {
  const double th = consts::kEarthRotation * (t - t0);
  const double c = std::cos(th), s = std::sin(th);
  const double Sr[3] = {c * S[0] - s * S[1], s * S[0] + c * S[1], S[2]};
  const double a1 = std::acos(COS_PHI_V(Sr, nodes));
  const double a2 = std::acos(COS_PHI_V(Sr, nodes + 3));
  return (a1 > a2) ? -a1 : a1;
}

double rr2th(const double X[3], const double V[3], const double S[3], int side, double* squint) {
  double D[3];
  sub3(X, S, D);
  const double rs = norm3(S), rx = norm3(X), r = norm3(D);
  double look = std::acos(clampUnit((rs * rs + r * r - rx * rx) / (2.0 * rs * r))) * kRadToDeg;
  if (side != 0) look = 180.0 - look;
  if (squint) {
    double vh[3], dh[3];
    make_versor(V, vh);
    make_versor(D, dh);
    *squint = -std::asin(clampUnit(dot3(vh, dh))) * kRadToDeg;
  }
  return look;
}

int baseline(double t, const double* pts1, const double* pts2, double dt1, double dt2, double tau,
             double lambda, double fd, double lookSign, double out[3], double* tSlave,
             double* tauSlave) {
  double cx1[5], cy1[5], cz1[5], cx2[5], cy2[5], cz2[5];
  int status = orb_interp(0.0, pts1, dt1, cx1, cy1, cz1, 5);
  if (status == STATUS_OK) status = orb_interp(0.0, pts2, dt2, cx2, cy2, cz2, 5);
  if (status != STATUS_OK) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  if (t < 0.0 || t > 4.0 * dt1) return 12;
  double S1[3], V1[3], A1[3];
  POSVELACC_5(t, cx1, cy1, cz1, S1, V1, A1);
  const double a = consts::kWgs84A, b = consts::kWgs84B;
  double G[3], G2[3];
  status = gr_pt(G, S1, V1, tau, fd, lambda, 0.0, lookSign, a, b);
  if (status != STATUS_OK) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  double t2 = 0.0, tau2 = 0.0;
  if (inv_grpt(&t2, &tau2, pts2, G, dt2, lambda, fd) != STATUS_OK) return 13;
  if (t2 < 0.0 || t2 > 4.0 * dt2) return 14;
  double S2[3], V2[3], A2[3];
  POSVELACC_5(t2, cx2, cy2, cz2, S2, V2, A2);
  status = gr_pt(G2, S1, V1, tau + 5e-6, fd, lambda, 0.0, lookSign, a, b);
  if (status != STATUS_OK) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  double l[3], h[3], n[3], d[3], g2[3], B[3];
  sub3(G, S1, d);
  make_versor(d, l);
  sub3(G2, S1, g2);
  const double lg = dot3(l, g2);
  const double hRaw[3] = {g2[0] - l[0] * lg, g2[1] - l[1] * lg, g2[2] - l[2] * lg};
  make_versor(hRaw, h);
  v1pv2(l, h, n);
  sub3(S2, S1, B);
  out[0] = dot3(B, h);
  out[1] = dot3(B, l);
  out[2] = dot3(B, n);
  if (tSlave) *tSlave = t2;
  if (tauSlave) *tauSlave = tau2;
  return STATUS_OK;
}
