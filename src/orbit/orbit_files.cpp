#include "orbit/orbit_files.h"

#include <array>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>

#include "base/constants.h"
#include "base/status.h"
#include "diag/report.h"
#include "numerics/root_finding.h"
#include "orbit/orbit_file_io.h"
#include "product/byte_order.h"
#include "product/time_base.h"

using namespace orbit_file_io;

// ---- table size ----------------------------------------------------------------

void orbitTableSize(double t, double duration, double dt, double* t0, int* nSV) {
  if (duration < 15.0) {
    *nSV = 5;
    *t0 = t + duration / 2.0 - 10.0;
    return;
  }
  *t0 = t - 0.2 * duration;
  double x = (1.4 * duration / dt + 1.0) / 2.0;
  int half = static_cast<int>(x >= 0 ? std::floor(x + 0.5) : std::ceil(x - 0.5));
  *nSV = 2 * half + 1;
}

void orbitTableSizeCentred(double t, double duration, double dt, double* t0, int* nSV) {
  double x = (1.4 * duration / dt + 1.0) / 2.0;
  int half = static_cast<int>(x >= 0 ? std::floor(x + 0.5) : std::ceil(x - 0.5));
  if (half < 2) half = 2;
  *nSV = 2 * half + 1;
  *t0 = t - 10.0;
  // Wider tables keep t in their middle.
  if (*nSV > 5) *t0 = t - half * dt;
}

// ---- Lagrange ----------------------------------------------------------------

int interp_orb_Lagrange(const double* pts, const double* times, double* out,
                        const double* outTimes, int n) {
  // Denominators of the barycentric weights of nine equidistant nodes:
  // (-1)^j j! (8 - j)!.
  static constexpr double kW[9] = {40320.0, -5040.0, 1440.0, -720.0, 576.0,
                                   -720.0,  1440.0,  -5040.0, 40320.0};
  const double h = times[1] - times[0];
  if (h == 0.0) return STATUS_BAD_CONDITION;
  double x[9];
  for (int j = 0; j < 9; ++j) x[j] = (times[j] - times[0]) / h;
  for (int i = 0; i < n; ++i) {
    const double u = (outTimes[i] - times[0]) / h;
    int onNode = -1;
    for (int j = 0; j < 9; ++j)
      if (u == x[j]) onNode = j;
    if (onNode >= 0) {
      for (int a = 0; a < 3; ++a) out[3 * i + a] = pts[3 * onNode + a];
      continue;
    }
    double num[3] = {0.0, 0.0, 0.0};
    double den = 0.0;
    for (int j = 0; j < 9; ++j) {
      const double term = 1.0 / (kW[j] * (u - x[j]));
      den += term;
      for (int a = 0; a < 3; ++a) num[a] += term * pts[3 * j + a];
    }
    for (int a = 0; a < 3; ++a) out[3 * i + a] = num[a] / den;
  }
  return STATUS_OK;
}


// ---- shared interpolation of point tables -----------------------------------------

int interp_orb_records(const OrbitRecords& rec, double tCentre, double t0, double dt, int n,
                       double* pos, double* vel) {
  if (rec.size() < 9) {
    ORV_REPORT("Fewer than 9 orbit points for the interpolation", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  const int s = nineNodeStart(nearestRecord(rec.times, tCentre), rec.size());
  for (int k = 0; k < n; ++k) {
    const double tk = t0 + k * dt;
    lagrange9(&rec.pos[3 * static_cast<std::size_t>(s)], &rec.times[s], tk, pos + 3 * k);
    if (vel) lagrange9(&rec.vel[3 * static_cast<std::size_t>(s)], &rec.times[s], tk, vel + 3 * k);
  }
  return STATUS_OK;
}

// ---- frames ------------------------------------------------------------------------

double greenwich_angle(double sec85) {
  // Julian centuries of UT1 (taken as UTC) from J2000.0; 1985-01-01 00:00 is
  // JD 2446066.5.
  const double jd = 2446066.5 + sec85 / 86400.0;
  const double tu = (jd - 2451545.0) / 36525.0;
  double gmst = 67310.54841 + (876600.0 * 3600.0 + 8640184.812866) * tu + 0.093104 * tu * tu -
                6.2e-6 * tu * tu * tu;  // seconds of time
  gmst = std::fmod(gmst, 86400.0);
  if (gmst < 0) gmst += 86400.0;
  return gmst / 86400.0 * 2.0 * consts::kPi;
}

void inertial_to_earth_fixed(double g, const double posIn[3], const double velIn[3],
                             double posOut[3], double velOut[3]) {
  const double c = std::cos(g), s = std::sin(g);
  const double w = consts::kEarthRotation;
  const double x = c * posIn[0] + s * posIn[1];
  const double y = -s * posIn[0] + c * posIn[1];
  const double vx = c * velIn[0] + s * velIn[1];
  const double vy = -s * velIn[0] + c * velIn[1];
  posOut[0] = x;
  posOut[1] = y;
  posOut[2] = posIn[2];
  velOut[0] = vx + w * y;
  velOut[1] = vy - w * x;
  velOut[2] = velIn[2];
}

