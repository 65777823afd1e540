#include "orbit/radarsat_orbit.h"

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

// ---- RADARSAT ---------------------------------------------------------------------------

namespace {

// "YYYY DDD HH:MM:SS.ffffff" after a block name; false if malformed.
bool parseDoyTime(const char* s, double* t, const char** end) {
  char year[8];
  int doy = 0, hh = 0, mm = 0, used = 0;
  double ss = 0.0;
  if (std::sscanf(s, " %4s %d %d:%d:%lf%n", year, &doy, &hh, &mm, &ss, &used) != 5) return false;
  char base[64];
  std::snprintf(base, sizeof base, "01-JAN-%s 00:00:00.000000", year);
  *t = ascii2sec85(base) + (doy - 1) * 86400.0 + hh * 3600.0 + mm * 60.0 + ss;
  if (end) *end = s + used;
  return true;
}

}  // namespace

int read_radarsat_orbit(const std::string& path, OrbitRecords& out) {
  out = OrbitRecords{};
  int st;
  std::vector<char> d = readWhole(path, &st);
  if (st != 0) return st;
  d.push_back('\0');
  const char* text = d.data();
  const char* names[] = {"GENERATION TIME", "ORBIT NUMBER", "GREENWICH ANGLE", "FIRST MODEL",
                         "SECOND MODEL"};
  const char* at[5];
  for (int k = 0; k < 5; ++k) {
    at[k] = std::strstr(text, names[k]);
    if (!at[k]) {
      ORV_REPORT(std::string(names[k]) + " not found in the Orbit file", REPORT_ERROR);
      return STATUS_BAD_CONDITION;
    }
  }
  double tg = 0.0, g0 = 0.0;
  const char* rest = nullptr;
  const char* ga = std::strchr(at[2], ':');
  if (!ga || !parseDoyTime(ga + 1, &tg, &rest) || std::sscanf(rest, "%lf", &g0) != 1) {
    ORV_REPORT("GREENWICH ANGLE not found in the Orbit file", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  g0 *= consts::kPi / 180.0;
  for (const char* s = std::strstr(text, "STATE VECTOR"); s; s = std::strstr(s + 1, "STATE VECTOR")) {
    const char* c = std::strchr(s, ':');
    double t, p[6];
    if (!c || !parseDoyTime(c + 1, &t, &rest)) continue;
    if (std::sscanf(rest, "%lf %lf %lf %lf %lf %lf", p, p + 1, p + 2, p + 3, p + 4, p + 5) != 6)
      continue;
    double pe[3], ve[3];
    inertial_to_earth_fixed(g0 + consts::kEarthRotation * (t - tg), p, p + 3, pe, ve);
    pushPoint(out, t, pe, ve);
  }
  if (out.size() < 9) {
    ORV_REPORT("Fewer than 9 state vectors in " + path, REPORT_ERROR);
    return STATUS_READ_FAILED;
  }
  return STATUS_OK;
}

int interp_orb_l_v2(const std::string& path, double t, int n, double dt, double* pos, double* vel) {
  OrbitRecords rec;
  int st = read_radarsat_orbit(path, rec);
  if (st != 0) return st;
  // The table must lie inside the file's vectors: no extrapolation.
  const double first = t - (n - 1) / 2.0 * dt, last = t + (n - 1) / 2.0 * dt;
  if (first < rec.times.front() || last > rec.times.back()) {
    ORV_REPORT("The RADARSAT orbit file " + path + " does not cover the scene", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  return interp_orb_records(rec, t, first, dt, n, pos, vel);
}

