#include "sim/sim_geometry.h"

#include <cmath>
#include <cstdio>
#include <cstring>

#include "base/constants.h"

namespace {

constexpr double kGM = 3.986004418e14;
constexpr double kDeg = consts::kPi / 180.0;
const char* const kMonths[12] = {"JAN", "FEB", "MAR", "APR", "MAY", "JUN",
                                 "JUL", "AUG", "SEP", "OCT", "NOV", "DEC"};

// Days from 1970-01-01 of a proleptic Gregorian date.
long daysFromCivil(long y, int m, int d) {
  y -= m <= 2;
  const long era = (y >= 0 ? y : y - 399) / 400;
  const long yoe = y - era * 400;
  const long doy = (153 * (m + (m > 2 ? -3 : 9)) + 2) / 5 + d - 1;
  const long doe = yoe * 365 + yoe / 4 - yoe / 100 + doy;
  return era * 146097 + doe - 719468;
}

void civilFromDays(long z, int& y, int& m, int& d) {
  z += 719468;
  const long era = (z >= 0 ? z : z - 146096) / 146097;
  const long doe = z - era * 146097;
  const long yoe = (doe - doe / 1460 + doe / 36524 - doe / 146096) / 365;
  const long doy = doe - (365 * yoe + yoe / 4 - yoe / 100);
  const long mp = (5 * doy + 2) / 153;
  d = static_cast<int>(doy - (153 * mp + 2) / 5 + 1);
  m = static_cast<int>(mp < 10 ? mp + 3 : mp - 9);
  y = static_cast<int>(yoe + era * 400 + (m <= 2));
}

const long kDays1985 = daysFromCivil(1985, 1, 1);

// Millisecond-rounded split of a time into whole days, ms of day.
void splitMs(double sec85, long& day, long& msOfDay) {
  const long long ms = std::llround(sec85 * 1000.0);
  day = static_cast<long>(ms / 86400000LL);
  msOfDay = static_cast<long>(ms % 86400000LL);
  if (msOfDay < 0) {
    msOfDay += 86400000L;
    --day;
  }
}

}  // namespace

double norm(const Vec3& a) { return std::sqrt(dot(a, a)); }

double simSec85(const CivilTime& c) {
  const long days = daysFromCivil(c.year, c.month, c.day) - kDays1985;
  return days * 86400.0 + c.hour * 3600.0 + c.minute * 60.0 + c.second;
}

CivilTime simCivil(double sec85) {
  CivilTime c;
  double days = std::floor(sec85 / 86400.0);
  double sod = sec85 - days * 86400.0;
  civilFromDays(static_cast<long>(days) + kDays1985, c.year, c.month, c.day);
  c.hour = static_cast<int>(sod / 3600.0);
  sod -= c.hour * 3600.0;
  c.minute = static_cast<int>(sod / 60.0);
  c.second = sod - c.minute * 60.0;
  return c;
}

int simDayOfYear(int year, int month, int day) {
  return static_cast<int>(daysFromCivil(year, month, day) - daysFromCivil(year, 1, 1)) + 1;
}

const char* simMonthName(int month) { return (month >= 1 && month <= 12) ? kMonths[month - 1] : "???"; }

std::string simDateText(double sec85) {
  long day = 0, ms = 0;
  splitMs(sec85, day, ms);
  int y = 0, m = 0, d = 0;
  civilFromDays(day + kDays1985, y, m, d);
  char buf[64];
  std::snprintf(buf, sizeof buf, "%02d-%s-%04d %02ld:%02ld:%02ld.%03ld", d, kMonths[m - 1], y,
                ms / 3600000L, (ms / 60000L) % 60, (ms / 1000L) % 60, ms % 1000L);
  return buf;
}

std::string simCompactDateText(double sec85) {
  long day = 0, ms = 0;
  splitMs(sec85, day, ms);
  int y = 0, m = 0, d = 0;
  civilFromDays(day + kDays1985, y, m, d);
  char buf[64];
  std::snprintf(buf, sizeof buf, "%04d%02d%02d%02ld%02ld%02ld%03ld", y, m, d, ms / 3600000L,
                (ms / 60000L) % 60, (ms / 1000L) % 60, ms % 1000L);
  return buf;
}

bool simParseDate(const std::string& text, double& sec85) {
  int d = 0, y = 0, hh = 0, mm = 0;
  char mon[4] = {0};
  double ss = 0.0;
  if (std::sscanf(text.c_str(), " %d-%3s-%d %d:%d:%lf", &d, mon, &y, &hh, &mm, &ss) != 6) return false;
  int month = 0;
  for (int i = 0; i < 12; ++i)
    if (std::strncmp(mon, kMonths[i], 3) == 0) month = i + 1;
  if (month == 0 || d < 1 || d > 31 || hh < 0 || hh > 23 || mm < 0 || mm > 59 || ss < 0 || ss >= 61)
    return false;
  sec85 = simSec85({y, month, d, hh, mm, ss});
  return true;
}

// ---------------------------------------------------------------- orbit

SimOrbit::SimOrbit(const KeplerElements& k) : k_(k), n_(std::sqrt(kGM / (k.semiMajorAxis * k.semiMajorAxis * k.semiMajorAxis))) {}

StateVector SimOrbit::at(double t) const {
  const double dt = t - k_.epoch;
  const double e = k_.eccentricity;
  const double M = k_.meanAnomalyDeg * kDeg + n_ * dt;
  double E = M;
  for (int i = 0; i < 30; ++i) {
    const double dE = (E - e * std::sin(E) - M) / (1.0 - e * std::cos(E));
    E -= dE;
    if (std::fabs(dE) < 1e-15) break;
  }
  const double a = k_.semiMajorAxis;
  const double cosE = std::cos(E), sinE = std::sin(E);
  const double sq = std::sqrt(1.0 - e * e);
  // Perifocal position and velocity.
  const double xp = a * (cosE - e), yp = a * sq * sinE;
  const double edot = n_ / (1.0 - e * cosE);
  const double vxp = -a * sinE * edot, vyp = a * sq * cosE * edot;
  const double O = k_.nodeLongitudeDeg * kDeg, w = k_.argPerigeeDeg * kDeg, inc = k_.inclinationDeg * kDeg;
  const double cO = std::cos(O), sO = std::sin(O), cw = std::cos(w), sw = std::sin(w);
  const double ci = std::cos(inc), si = std::sin(inc);
  const Vec3 P{cO * cw - sO * sw * ci, sO * cw + cO * sw * ci, sw * si};
  const Vec3 Q{-cO * sw - sO * cw * ci, -sO * sw + cO * cw * ci, cw * si};
  const Vec3 ri = xp * P + yp * Q;
  const Vec3 vi = vxp * P + vyp * Q;
  // Earth-fixed: rotate by the Earth's rotation since the epoch.
  const double th = consts::kEarthRotation * dt;
  const double c = std::cos(th), s = std::sin(th);
  StateVector sv;
  sv.t = t;
  sv.pos = {c * ri[0] + s * ri[1], -s * ri[0] + c * ri[1], ri[2]};
  const Vec3 vr{c * vi[0] + s * vi[1], -s * vi[0] + c * vi[1], vi[2]};
  sv.vel = {vr[0] + consts::kEarthRotation * sv.pos[1], vr[1] - consts::kEarthRotation * sv.pos[0], vr[2]};
  return sv;
}

// ---------------------------------------------------------------- geodesy

Vec3 geodeticToEcef(double latDeg, double lonDeg, double height) {
  const double a = consts::kWgs84A, b = consts::kWgs84B;
  const double e2 = 1.0 - (b * b) / (a * a);
  const double lat = latDeg * kDeg, lon = lonDeg * kDeg;
  const double sl = std::sin(lat), cl = std::cos(lat);
  const double N = a / std::sqrt(1.0 - e2 * sl * sl);
  return {(N + height) * cl * std::cos(lon), (N + height) * cl * std::sin(lon), (N * (1.0 - e2) + height) * sl};
}

void ecefToGeodetic(const Vec3& p, double& latDeg, double& lonDeg, double& height) {
  const double a = consts::kWgs84A, b = consts::kWgs84B;
  const double e2 = 1.0 - (b * b) / (a * a);
  const double r = std::hypot(p[0], p[1]);
  double lat = std::atan2(p[2], r * (1.0 - e2));
  double h = 0.0;
  for (int i = 0; i < 10; ++i) {
    const double sl = std::sin(lat);
    const double N = a / std::sqrt(1.0 - e2 * sl * sl);
    h = r / std::cos(lat) - N;
    lat = std::atan2(p[2], r * (1.0 - e2 * N / (N + h)));
  }
  const double sl = std::sin(lat);
  const double N = a / std::sqrt(1.0 - e2 * sl * sl);
  height = std::fabs(std::cos(lat)) > 1e-9 ? r / std::cos(lat) - N : std::fabs(p[2]) - b;
  latDeg = lat / kDeg;
  lonDeg = std::atan2(p[1], p[0]) / kDeg;
}

Vec3 deosToEcef(double latDeg, double lonDeg, double h) {
  const double lat = latDeg * kDeg, lon = lonDeg * kDeg;
  const double b = std::atan(std::tan(lat) * 0.9933056199794559);
  const double r = 6356752.314147896 / std::sqrt(1.0 - 0.006694380020544122 * std::cos(b) * std::cos(b));
  const double d = lat - b;
  const double R = std::sqrt(r * r + 2.0 * h * r * std::cos(d) + h * h);
  const double g = std::asin(std::sin(d) * h / R) + b;
  return {R * std::cos(g) * std::cos(lon), R * std::cos(g) * std::sin(lon), R * std::sin(g)};
}

void ecefToDeos(const Vec3& p, double& latDeg, double& lonDeg, double& height) {
  double lat = 0.0, lon = 0.0, h = 0.0;
  ecefToGeodetic(p, lat, lon, h);
  lonDeg = lon;
  // Newton on (lat, h) in the meridian plane: radius and z of the forward form.
  const double rho = std::hypot(p[0], p[1]);
  for (int it = 0; it < 8; ++it) {
    const Vec3 q = deosToEcef(lat, 0.0, h);
    const double f1 = q[0] - rho, f2 = q[2] - p[2];
    if (std::fabs(f1) < 1e-7 && std::fabs(f2) < 1e-7) break;
    const double dl = 1e-6, dh = 1.0;
    const Vec3 ql = deosToEcef(lat + dl, 0.0, h);
    const Vec3 qh = deosToEcef(lat, 0.0, h + dh);
    const double a11 = (ql[0] - q[0]) / dl, a12 = (qh[0] - q[0]) / dh;
    const double a21 = (ql[2] - q[2]) / dl, a22 = (qh[2] - q[2]) / dh;
    const double det = a11 * a22 - a12 * a21;
    lat -= (a22 * f1 - a12 * f2) / det;
    h -= (-a21 * f1 + a11 * f2) / det;
  }
  latDeg = lat;
  height = h;
}

// ---------------------------------------------------------------- geometry

double closestApproachTime(const SimOrbit& orbit, const Vec3& target, double tGuess) {
  auto f = [&](double t) {
    const StateVector sv = orbit.at(t);
    return dot(sv.pos - target, sv.vel);
  };
  double t = tGuess;
  for (int it = 0; it < 50; ++it) {
    const double h = 1e-3;
    const double f0 = f(t);
    const double d = (f(t + h) - f(t - h)) / (2.0 * h);
    double step = f0 / d;
    if (std::fabs(step) > 30.0) step = step > 0 ? 30.0 : -30.0;
    t -= step;
    if (std::fabs(step) < 1e-11) break;
  }
  return t;
}

double pointDoppler(const StateVector& sv, const Vec3& target, double lambda) {
  const Vec3 d = sv.pos - target;
  return -2.0 / lambda * dot(d, sv.vel) / norm(d);
}

bool zeroDopplerPoint(const SimOrbit& orbit, double t, double range, double height, int lookSign,
                      double& latDeg, double& lonDeg) {
  const StateVector sv = orbit.at(t);
  double lat = 0.0, lon = 0.0, hs = 0.0;
  ecefToGeodetic(sv.pos, lat, lon, hs);
  const Vec3 down = (-1.0 / norm(sv.pos)) * sv.pos;
  const Vec3 vhat = (1.0 / norm(sv.vel)) * sv.vel;
  Vec3 side = cross(down, vhat);
  side = (lookSign >= 0 ? 1.0 : -1.0) / norm(side) * side;
  const double alt = hs - height;
  if (range <= alt) return false;
  const double g = std::sqrt(range * range - alt * alt);
  const Vec3 nadir = geodeticToEcef(lat, lon, height);
  double plat = 0.0, plon = 0.0, ph = 0.0;
  ecefToGeodetic(nadir + g * side, plat, plon, ph);
  auto eq = [&](double la, double lo, double& f1, double& f2) {
    const Vec3 p = geodeticToEcef(la, lo, height);
    const Vec3 d = p - sv.pos;
    f1 = norm(d) - range;
    f2 = dot(d, vhat);
  };
  for (int it = 0; it < 30; ++it) {
    double f1 = 0, f2 = 0;
    eq(plat, plon, f1, f2);
    if (std::fabs(f1) < 1e-6 && std::fabs(f2) < 1e-6) {
      latDeg = plat;
      lonDeg = plon;
      return true;
    }
    const double dd = 1e-6;
    double g1 = 0, g2 = 0, k1 = 0, k2 = 0;
    eq(plat + dd, plon, g1, g2);
    eq(plat, plon + dd, k1, k2);
    const double a11 = (g1 - f1) / dd, a21 = (g2 - f2) / dd, a12 = (k1 - f1) / dd, a22 = (k2 - f2) / dd;
    const double det = a11 * a22 - a12 * a21;
    if (det == 0.0) return false;
    plat -= (a22 * f1 - a12 * f2) / det;
    plon -= (-a21 * f1 + a11 * f2) / det;
  }
  return false;
}
