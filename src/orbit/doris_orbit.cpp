#include "orbit/doris_orbit.h"

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

namespace {

// ---- DORIS-type files ------------------------------------------------------

constexpr int kMphSize = 1247;
constexpr int kSphSize = 378;
constexpr int kDorRecordSize = 129;

struct DorRecord {
  double time = 0.0;
  int orbit = 0;
  double pos[3] = {0, 0, 0};
  double vel[3] = {0, 0, 0};
};

void parseDorRecord(const char* rec, DorRecord& r) {
  r.time = ascii2sec85(field(rec, 0, 27));
  r.orbit = fieldInt(rec, 37, 6);
  for (int k = 0; k < 3; ++k) {
    r.pos[k] = fieldDouble(rec, 44 + 13 * k, 13);
    r.vel[k] = fieldDouble(rec, 83 + 13 * k, 13);
  }
}

bool isDorisProduct(const std::string& name) {
  return name == "DOR_VOR_AX" || name == "DOR_POR_AX" || name == "AUX_FRO_AX" ||
         name == "AUX_FPO_AX";
}

// Open file with its data-set position; status as interp_orb_l.
struct DorFile {
  FilePtr f;
  double start = 0.0, stop = 0.0;
  long dsOffset = 0;
  int count = 0;
};

int openDorFile(const std::string& path, DorFile& d) {
  d.f = openForReading(path);
  if (!d.f) {
    ORV_REPORT("File not opened! (" + path + ")", REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  char mph[kMphSize];
  if (!readAt(d.f.get(), 0, mph, sizeof mph)) return reportReadFailed(path);
  if (!isDorisProduct(field(mph, 9, 10))) return 12;
  d.start = ascii2sec85(field(mph, 351, 27));
  d.stop = ascii2sec85(field(mph, 394, 27));
  char sph[kSphSize + 1];
  if (!readAt(d.f.get(), kMphSize, sph, kSphSize)) return reportReadFailed(path);
  sph[kSphSize] = '\0';
  if (std::sscanf(sph + 231, "%ld", &d.dsOffset) != 1 || std::sscanf(sph + 305, "%d", &d.count) != 1 ||
      d.dsOffset < 0 || d.count < 0) {
    ORV_REPORT("Bad data set offset or record count in " + path, REPORT_ERROR);
    return STATUS_READ_FAILED;
  }
  return STATUS_OK;
}

int readDorRecord(DorFile& d, int i, DorRecord& r) {
  char rec[kDorRecordSize + 1];
  if (!readAt(d.f.get(), d.dsOffset + static_cast<long>(i) * kDorRecordSize, rec, kDorRecordSize))
    return STATUS_READ_FAILED;
  rec[kDorRecordSize] = '\0';
  parseDorRecord(rec, r);
  return STATUS_OK;
}

// Nine consecutive records from `start` as node tables.
int readNineDor(DorFile& d, int start, double times[9], double pos[27], double vel[27]) {
  for (int k = 0; k < 9; ++k) {
    DorRecord r;
    if (readDorRecord(d, start + k, r) != 0) return STATUS_READ_FAILED;
    times[k] = r.time;
    for (int a = 0; a < 3; ++a) {
      pos[3 * k + a] = r.pos[a];
      vel[3 * k + a] = r.vel[a];
    }
  }
  return STATUS_OK;
}

}  // namespace

// ---- DORIS-type reader ---------------------------------------------------------

int interp_orb_l(const std::string& path, double t, int n, double dt, double* pos, double* vel,
                 int* orbitOut, int wantNode, double* nodeOut) {
  DorFile d;
  int st = openDorFile(path, d);
  if (st != 0) return st;
  if (t < d.start || t > d.stop) {
    ORV_REPORT(
        "Requested orbit information at an invalid time: centr_time < start_time || centr_time > "
        "stop_time)",
        REPORT_ERROR);
    return 13;
  }
  if (d.count < 9) {
    ORV_REPORT("Fewer than 9 orbit records in " + path, REPORT_ERROR);
    return STATUS_READ_FAILED;
  }

  // Walk to the first record at or past t, noting the first rising crossing
  // of the equator.
  int r = -1, nodeRecord = -1;
  DorRecord prev, cur;
  for (int i = 0; i < d.count; ++i) {
    if (readDorRecord(d, i, cur) != 0) return reportReadFailed(path);
    if (i > 0 && nodeRecord < 0 && prev.pos[2] < 0.0 && cur.pos[2] >= 0.0) nodeRecord = i;
    if (cur.time >= t) {
      r = i;
      break;
    }
    prev = cur;
  }
  if (r < 0) {
    r = d.count - 1;
    cur = prev;
  }
  if (orbitOut) {
    if (r > 0 && std::fabs(prev.time - t) < std::fabs(cur.time - t))
      *orbitOut = prev.orbit;
    else
      *orbitOut = cur.orbit;
  }

  int start = r - 5;
  if (start < 0) start = 0;
  if (start > d.count - 9) start = d.count - 9;
  double times[9], npos[27], nvel[27];
  if (readNineDor(d, start, times, npos, nvel) != 0) return reportReadFailed(path);

  for (int i = 0; i < n; ++i) {
    double ti = t + (i - (n - 1) / 2.0) * dt;
    lagrange9(npos, times, ti, pos + 3 * i);
    if (vel) lagrange9(nvel, times, ti, vel + 3 * i);
  }

  if (wantNode == 1) {
    if (nodeRecord < 0) {
      std::fprintf(stderr, "Cannot compute ascending node time: no change in orbit number\n");
      return STATUS_BAD_CONDITION;
    }
    int ns = nodeRecord - 5;
    if (ns < 0) ns = 0;
    if (ns > d.count - 9) ns = d.count - 9;
    double nt[9], np[27], nv[27];
    if (readNineDor(d, ns, nt, np, nv) != 0) return reportReadFailed(path);
    auto z = [&](double tt) {
      double p[3];
      lagrange9(np, nt, tt, p);
      return p[2];
    };
    double tn = nt[nodeRecord - ns];
    int rst = 0;
    const double root = rtbis(z, tn - 180.0, tn, 1e-5, &rst);
    if (rst != 0) {
      ORV_REPORT_CALLED_ERROR();
      return rst;
    }
    if (nodeOut) *nodeOut = root;
  }
  return STATUS_OK;
}

int get_state_vectors(const std::string& path, double tStart, double tStop, OrbitRecords& out) {
  out = OrbitRecords{};
  DorFile d;
  int st = openDorFile(path, d);
  if (st != 0) return st;
  for (int i = 0; i < d.count; ++i) {
    DorRecord r;
    if (readDorRecord(d, i, r) != 0) return reportReadFailed(path);
    if (r.time < tStart) continue;
    if (r.time > tStop) break;
    out.times.push_back(r.time);
    out.orbit.push_back(r.orbit);
    out.pos.insert(out.pos.end(), r.pos, r.pos + 3);
    out.vel.insert(out.vel.end(), r.vel, r.vel + 3);
  }
  return STATUS_OK;
}

