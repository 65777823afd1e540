// State-vector tables of GeneralSAROrbit and SAROrbitStateVectors_Obj filled
// from precise orbit files.
#include <cmath>
#include <cstdio>
#include <cstring>
#include <new>

#include "base/constants.h"
#include "base/status.h"
#include "diag/report.h"
#include "orbit/general_sar_orbit.h"
#include "orbit/ground_geometry.h"
#include "orbit/deos_orbit.h"
#include "orbit/doris_orbit.h"
#include "orbit/orbit_files.h"
#include "orbit/palsar_orbit.h"
#include "orbit/radarsat_orbit.h"

// ---- GeneralSAROrbit loaders ----------------------------------------------------------

int GeneralSAROrbit::GetStateVectorsENVI(const std::string& path, double t, double duration) {
  const double step = kOrbitTableDt;
  double first;
  int n;
  orbitTableSize(t, duration, step, &first, &n);
  int st = SVCreate(first, step, n);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  st = interp_orb_l(path, (n - 1) * step / 2.0 + first, n, step, pos.data(), vel.data());
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  st = computeApproximateSV();
  if (st != 0) ORV_REPORT_CALLED_ERROR();
  return st;
}

int GeneralSAROrbit::GetStateVectorsERS(const std::string& path, double t, double duration,
                                        const std::string& satellite) {
  const double step = kOrbitTableDt;
  double first;
  int n;
  orbitTableSize(t, duration, step, &first, &n);
  int st = SVCreate(first, step, n);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  st = interp_orb_deos(path, t, satellite, first, step, n, pos.data());
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  st = computeApproximateSV();
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  // The arc has no velocities: take them from the fitted polynomials.
  for (int k = 0; k < n; ++k) SVGetVel(t0 + k * dt, &vel[3 * static_cast<std::size_t>(k)]);
  return STATUS_OK;
}

int GeneralSAROrbit::loadFromPoints(const OrbitRecords& rec, double t, double duration) {
  const double step = kOrbitTableDt;
  double first;
  int n;
  orbitTableSize(t, duration, step, &first, &n);
  int st = SVCreate(first, step, n);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  st = interp_orb_records(rec, t, first, step, n, pos.data(), vel.data());
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  st = computeApproximateSV();
  if (st != 0) ORV_REPORT_CALLED_ERROR();
  return st;
}

int GeneralSAROrbit::extract_palsar_lea(const std::string& path, double t, double duration) {
  OrbitRecords rec;
  int st = read_palsar_leader_orbit(path, rec);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  return loadFromPoints(rec, t, duration);
}

int GeneralSAROrbit::extract_palsar_POD(const std::string& path, double t, double duration) {
  OrbitRecords rec;
  int st = read_palsar_orbit_file(path, rec);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  return loadFromPoints(rec, t, duration);
}

int GeneralSAROrbit::extract_palsar_COD(const std::string& path, double t, double duration) {
  return extract_palsar_POD(path, t, duration);
}

int GeneralSAROrbit::GetStateVectorsPAL(const std::string& path, double t, double duration) {
  std::FILE* f = std::fopen(path.c_str(), "rb");
  if (!f) {
    ORV_REPORT("File not opened! (" + path + ")", REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  char head[28] = {};
  const std::size_t got = std::fread(head, 1, 28, f);
  std::fclose(f);
  if (got >= 28 && std::memcmp(head + 16, "CEOS-SAR-CCT", 12) == 0)
    return extract_palsar_lea(path, t, duration);
  if (got >= 6 && std::memcmp(head, "ALEOCF", 6) == 0) return extract_palsar_COD(path, t, duration);
  if (got >= 6 && std::memcmp(head, "ALDSEF", 6) == 0) return extract_palsar_POD(path, t, duration);
  ORV_REPORT("Orbit File Type Not Supported!", REPORT_ERROR);
  return STATUS_BAD_CONDITION;
}

int GeneralSAROrbit::GetStateVectorsRADAR(const std::string& path, double t, double duration) {
  const double step = kOrbitTableDt;
  double first;
  int n;
  orbitTableSizeCentred(t, duration, step, &first, &n);
  int st = SVCreate(first, step, n);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  st = interp_orb_l_v2(path, t, n, step, pos.data(), vel.data());
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  st = computeApproximateSV();
  if (st != 0) ORV_REPORT_CALLED_ERROR();
  return st;
}

// ---- SAROrbitStateVectors_Obj -------------------------------------------------------------

SAROrbitStateVectors_Obj::SAROrbitStateVectors_Obj() { createElementsVector(5); }

void SAROrbitStateVectors_Obj::refreshParameters() {
  const int n = nSV > 0 ? nSV : 0;
  addElementDouble("pSV_m", pos.empty() ? nullptr : pos.data(), 3 * n, -1.0e12, 1.0e12, true);
  addElementDouble("vSV_mOs", vel.empty() ? nullptr : vel.data(), 3 * n, -1.0e12, 1.0e12, true);
  addElementDouble("t0SV_s", &t0, 1, -1.0e12, 1.0e12, true);
  addElementDouble("dtSV_s", &dt, 1, -1.0e12, 1.0e12, true);
  addElementInt("nSV_n", &nSV, 1, -999, 2147483647, true);
}

int SAROrbitStateVectors_Obj::createBuffers() {
  if (nSV <= 0) return STATUS_OK;
  try {
    const std::size_t n = static_cast<std::size_t>(nSV);
    pos.assign(3 * n, 0.0);
    vel.assign(3 * n, 0.0);
    for (auto* p : {&polyPX, &polyPY, &polyPZ, &polyVX, &polyVY, &polyVZ}) p->assign(n, 0.0);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory for the state vectors", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  refreshParameters();
  setAllocationFlag(true);
  return STATUS_OK;
}

int SAROrbitStateVectors_Obj::destroyBuffers() {
  pos.clear();
  vel.clear();
  for (auto* p : {&polyPX, &polyPY, &polyPZ, &polyVX, &polyVY, &polyVZ}) p->clear();
  refreshParameters();
  setAllocationFlag(false);
  return STATUS_OK;
}

int SAROrbitStateVectors_Obj::readhdr(const std::string& file) {
  GeneralSAROrbit orbit;
  if (orbit.readhdr(file) != 0 || orbit.nSV < 1) return STATUS_BAD_CONDITION;
  int st = SVCreate(orbit.t0, orbit.dt, orbit.nSV);
  if (st != 0) return st;
  pos = orbit.pos;
  vel = orbit.vel;
  refreshParameters();
  return SVPolyCompute();
}

int SAROrbitStateVectors_Obj::SVCreate(double t0Value, double dtValue, int n) {
  destroyBuffers();
  if (n < 1) {
    ORV_REPORT("Bad number of state vectors", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  t0 = t0Value;
  dt = dtValue;
  nSV = n;
  return createBuffers();
}

int SAROrbitStateVectors_Obj::SVPolyCompute() {
  if (pos.empty()) return STATUS_BAD_CONDITION;
  int st = orb_interp(0.0, pos.data(), dt, polyPX.data(), polyPY.data(), polyPZ.data(), nSV);
  if (st == 0) st = orb_interp(0.0, vel.data(), dt, polyVX.data(), polyVY.data(), polyVZ.data(), nSV);
  if (st != 0) ORV_REPORT_CALLED_ERROR();
  return st;
}

int SAROrbitStateVectors_Obj::SVGetPos(double t, double out[3]) const {
  if (pos.empty()) return STATUS_BAD_CONDITION;
  const double u = t - t0;
  out[0] = POSMACRO(u, polyPX.data(), nSV);
  out[1] = POSMACRO(u, polyPY.data(), nSV);
  out[2] = POSMACRO(u, polyPZ.data(), nSV);
  return STATUS_OK;
}

int SAROrbitStateVectors_Obj::SVGetVel(double t, double out[3]) const {
  if (pos.empty()) return STATUS_BAD_CONDITION;
  const double u = t - t0;
  out[0] = POSMACRO(u, polyVX.data(), nSV);
  out[1] = POSMACRO(u, polyVY.data(), nSV);
  out[2] = POSMACRO(u, polyVZ.data(), nSV);
  return STATUS_OK;
}

namespace {
int recordOfFirstFive(const SAROrbitStateVectors_Obj& sv, double t, double tau, double lambda,
                      grPtRecord* rec) {
  if (sv.pos.size() < 15) return STATUS_BAD_CONDITION;
  std::memset(rec, 0, sizeof *rec);
  std::memcpy(rec->pos, sv.pos.data(), 15 * sizeof(double));
  rec->t0 = sv.t0;
  rec->dt = sv.dt;
  rec->t = t;
  rec->tau = tau;
  rec->lambda = lambda;
  rec->lookSign = sv.lookSign;
  return gr_pt_lat_lon(rec, consts::kWgs84A, consts::kWgs84B);
}
}  // namespace

int SAROrbitStateVectors_Obj::SVGetLatLon(double t, double tau, double lambda, double* lat,
                                          double* lon) const {
  grPtRecord rec;
  int st = recordOfFirstFive(*this, t, tau, lambda, &rec);
  if (st != 0) return st;
  *lat = rec.lat;
  *lon = rec.lon;
  return STATUS_OK;
}

int SAROrbitStateVectors_Obj::SVGetAngles(double t, double tau, double lambda, double* inc,
                                          double* look) const {
  grPtRecord rec;
  int st = recordOfFirstFive(*this, t, tau, lambda, &rec);
  if (st != 0) return st;
  *inc = rec.incidence;
  *look = rec.look;
  return STATUS_OK;
}

// n vectors 5 s apart centred on the scene.
int GetStateVectorsENVI(const std::string& path, double t, double duration, int n,
                        SAROrbitStateVectors_Obj* sv) {
  const double step = kOrbitTableDt, centre = t + duration / 2.0;
  int st = sv->SVCreate(centre - (n - 1) * step / 2.0, step, n);
  if (st == 0) st = interp_orb_l(path, centre, n, step, sv->pos.data(), sv->vel.data());
  if (st == 0) st = sv->SVPolyCompute();
  if (st != 0) ORV_REPORT_CALLED_ERROR();
  return st;
}

int GetStateVectorsRADAR(const std::string& path, double t, double /*duration*/, int n,
                         SAROrbitStateVectors_Obj* sv) {
  const double step = kOrbitTableDt;
  int st = sv->SVCreate(t - (n - 1) * step / 2.0, step, n);
  if (st == 0) st = interp_orb_l_v2(path, t, n, step, sv->pos.data(), sv->vel.data());
  if (st == 0) st = sv->SVPolyCompute();
  if (st != 0) ORV_REPORT_CALLED_ERROR();
  return st;
}
