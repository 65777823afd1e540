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
#include "product/byte_order.h"
#include "product/time_base.h"

namespace {

struct FileCloser {
  void operator()(std::FILE* f) const {
    if (f) std::fclose(f);
  }
};
using FilePtr = std::unique_ptr<std::FILE, FileCloser>;

FilePtr openForReading(const std::string& path) { return FilePtr(std::fopen(path.c_str(), "rb")); }

std::string fmt(const char* format, const std::string& arg) {
  char buf[1200];
  std::snprintf(buf, sizeof buf, format, arg.c_str());
  return buf;
}

// Reads size bytes at offset; false on a short read.
bool readAt(std::FILE* f, long offset, void* dst, std::size_t size) {
  if (std::fseek(f, offset, SEEK_SET) != 0) return false;
  return std::fread(dst, 1, size, f) == size;
}

// Copy of a fixed-width text field, terminated.
std::string field(const char* bytes, int offset, int width) {
  return std::string(bytes + offset, static_cast<std::size_t>(width));
}

double fieldDouble(const char* bytes, int offset, int width) {
  std::string s = field(bytes, offset, width);
  double v = 0.0;
  if (std::sscanf(s.c_str(), "%lf", &v) != 1) return 0.0;
  return v;
}

int fieldInt(const char* bytes, int offset, int width) {
  std::string s = field(bytes, offset, width);
  int v = 0;
  if (std::sscanf(s.c_str(), "%d", &v) != 1) return 0;
  return v;
}

int reportReadFailed(const std::string& path) {
  ORV_REPORT("File reading failed! (" + path + ")", REPORT_ERROR);
  return STATUS_READ_FAILED;
}

// Start index of nine interpolation nodes around record i of count records.
int nineNodeStart(int i, int count) {
  int start = i - 4;
  if (start < 0) start = 0;
  if (start > count - 9) start = count - 9;
  return start;
}

// Index of the record nearest to t in ascending times.
int nearestRecord(const std::vector<double>& times, double t) {
  int best = 0;
  double bestD = std::fabs(times[0] - t);
  for (int i = 1; i < static_cast<int>(times.size()); ++i) {
    double d = std::fabs(times[i] - t);
    if (d < bestD) {
      bestD = d;
      best = i;
    }
  }
  return best;
}

// Lagrange interpolation of one axis-set of nine nodes at one time.
void lagrange9(const double* pts, const double* times, double t, double out[3]) {
  interp_orb_Lagrange(pts, times, out, &t, 1);
}

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

// ---- PALSAR helpers ----------------------------------------------------------

constexpr const char* kMonths = "JANFEBMARAPRMAYJUNJULAUGSEPOCTNOVDEC";

// Seconds since 1985 of midnight of a civil date, through the date text
// "DD-MMM-YYYY 00:00:00.000000".
double dayStart(int year, int month, int day) {
  if (month < 1 || month > 12) month = 1;
  char text[64];
  std::snprintf(text, sizeof text, "%02d-%.3s-%04d 00:00:00.000000", day, kMonths + 3 * (month - 1),
                year);
  return ascii2sec85(text);
}

}  // namespace

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

// ---- DEOS ODR ------------------------------------------------------------------

void deos_to_cartesian(double latDeg, double lonDeg, double height, double xyz[3]) {
  const double deg = consts::kPi / 180.0;
  const double lat = latDeg * deg, lon = lonDeg * deg;
  const double b = std::atan(std::tan(lat) * 0.9933056199794559);
  const double cb = std::cos(b);
  const double r = 6356752.314147896 / std::sqrt(1.0 - 0.006694380020544122 * cb * cb);
  const double d = lat - b;
  const double R = std::sqrt(r * r + 2.0 * height * r * std::cos(d) + height * height);
  const double g = std::asin(std::sin(d) * height / R) + b;
  xyz[0] = R * std::cos(g) * std::cos(lon);
  xyz[1] = R * std::cos(g) * std::sin(lon);
  xyz[2] = R * std::sin(g);
}

namespace {

struct OdrHeader {
  std::string id, satellite;
  int firstTime = 0, count = 0;
};

int readOdr(const std::string& path, OdrHeader& h, OrbitRecords& out) {
  out = OrbitRecords{};
  FilePtr f = openForReading(path);
  if (!f) {
    ORV_REPORT("File not opened! (" + path + ")", REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  unsigned char head[32];
  if (!readAt(f.get(), 0, head, 4)) return reportReadFailed(path);
  h.id.assign(reinterpret_cast<char*>(head), 4);
  if (h.id != "@ODR" && h.id != "xODR") {
    ORV_REPORT(fmt("The file %s is not a DEOS orbit file", path), REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (!readAt(f.get(), 0, head, 32)) return reportReadFailed(path);
  h.satellite.assign(reinterpret_cast<char*>(head) + 4, 8);
  h.firstTime = ch2int4(head + 12, kMsbFirst);
  h.count = ch2int4(head + 24, kMsbFirst);
  if (h.count < 0) {
    ORV_REPORT(fmt("Bad record count in DEOS orbit file %s", path), REPORT_ERROR);
    return STATUS_READ_FAILED;
  }
  // A count beyond the end of the file is a short read.
  if (std::fseek(f.get(), 0, SEEK_END) != 0 ||
      std::ftell(f.get()) < 32 + 16 * static_cast<long>(h.count))
    return reportReadFailed(path);
  const double scale = h.id == "@ODR" ? 1e-6 : 1e-7;
  std::vector<unsigned char> recs(static_cast<std::size_t>(h.count) * 16);
  if (!recs.empty() && !readAt(f.get(), 32, recs.data(), recs.size())) return reportReadFailed(path);
  out.times.resize(h.count);
  out.pos.resize(3 * static_cast<std::size_t>(h.count));
  for (int i = 0; i < h.count; ++i) {
    const unsigned char* p = recs.data() + 16 * static_cast<std::size_t>(i);
    out.times[i] = ch2int4(p, kMsbFirst);
    const double lat = ch2int4(p + 4, kMsbFirst) * scale;
    const double lon = ch2int4(p + 8, kMsbFirst) * scale;
    const double hgt = ch2int4(p + 12, kMsbFirst) * 1e-3;
    deos_to_cartesian(lat, lon, hgt, &out.pos[3 * static_cast<std::size_t>(i)]);
  }
  return STATUS_OK;
}

}  // namespace

int read_deos_odr(const std::string& path, OrbitRecords& out, std::string* satelliteName) {
  OdrHeader h;
  int st = readOdr(path, h, out);
  if (st == 0 && satelliteName) *satelliteName = h.satellite;
  return st;
}

int interp_orb_deos(const std::string& path, double t, const std::string& satellite, double t0,
                    double dt, int n, double* pos) {
  if (satellite != "ERS1" && satellite != "ERS2") {
    ORV_REPORT("Unknown satellite " + satellite + " for a DEOS orbit file", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  OdrHeader h;
  OrbitRecords rec;
  int st = readOdr(path, h, rec);
  if (st != 0) return st;
  const bool ers1 = h.satellite.compare(0, 5, "ERS-1") == 0;
  const bool ers2 = h.satellite.compare(0, 5, "ERS-2") == 0;
  if (!ers1 && !ers2) {
    ORV_REPORT(fmt("The file %s is not for ERS-1 or ERS-2 satellites", path), REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (satellite == "ERS1" && !ers1) {
    ORV_REPORT(fmt("The file %s is not for ERS-1 satellites", path), REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (satellite == "ERS2" && !ers2) {
    ORV_REPORT(fmt("The file %s is not for ERS-2 satellites", path), REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  // Coverage from the header; a time past the last record by more than one
  // spacing is refused as well, since nine-point extrapolation over hours
  // is meaningless.
  const double first = h.firstTime;
  if (t < first || t > first + h.count * kOrbitFileStep || h.count < 9 ||
      t > rec.times.back() + kOrbitFileStep) {
    ORV_REPORT(fmt("The file %s does not cover the image orbit", path), REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  const int i = nearestRecord(rec.times, t);
  const int s = nineNodeStart(i, h.count);
  for (int k = 0; k < n; ++k) {
    lagrange9(&rec.pos[3 * static_cast<std::size_t>(s)], &rec.times[s], t0 + k * dt, pos + 3 * k);
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

// ---- PALSAR --------------------------------------------------------------------------

namespace {

// Digits of a text field, in order.
std::string digitsOf(const std::string& s) {
  std::string d;
  for (char ch : s)
    if (ch >= '0' && ch <= '9') d += ch;
  return d;
}

int toInt(const std::string& s) { return s.empty() ? 0 : std::atoi(s.c_str()); }

std::vector<char> readWhole(const std::string& path, int* status) {
  std::vector<char> data;
  FilePtr f = openForReading(path);
  if (!f) {
    ORV_REPORT("File not opened! (" + path + ")", REPORT_ERROR);
    *status = STATUS_NOT_OPENED;
    return data;
  }
  char buf[65536];
  std::size_t got;
  while ((got = std::fread(buf, 1, sizeof buf, f.get())) > 0) data.insert(data.end(), buf, buf + got);
  *status = STATUS_OK;
  return data;
}

void pushPoint(OrbitRecords& out, double t, const double p[3], const double v[3]) {
  out.times.push_back(t);
  out.pos.insert(out.pos.end(), p, p + 3);
  out.vel.insert(out.vel.end(), v, v + 3);
}

}  // namespace

int read_palsar_orbit_file(const std::string& path, OrbitRecords& out) {
  out = OrbitRecords{};
  int st;
  std::vector<char> d = readWhole(path, &st);
  if (st != 0) return st;
  if (d.size() < 808) return reportReadFailed(path);
  const std::string frame = field(d.data(), 88, 3);
  const bool eci = frame == "ECI";
  if (frame != "ECR" && !eci) {
    ORV_REPORT("Axis Reference Not Supported!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  const std::string date = digitsOf(field(d.data(), 498, 10));
  if (date.size() != 8) {
    ORV_REPORT("Bad file date in " + path, REPORT_ERROR);
    return STATUS_READ_FAILED;
  }
  const double fileDay =
      dayStart(toInt(date.substr(0, 4)), toInt(date.substr(4, 2)), toInt(date.substr(6, 2)));
  for (std::size_t o = 808; o + 170 <= d.size(); o += 170) {
    const char* r = d.data() + o;
    const std::string stamp = field(r, 0, 20);
    if (digitsOf(stamp).size() != 20) break;  // end of the points
    const double day = dayStart(toInt(stamp.substr(0, 4)), toInt(stamp.substr(4, 2)),
                                toInt(stamp.substr(6, 2)));
    const double t = fileDay + (day - fileDay) + toInt(stamp.substr(8, 2)) * 3600.0 +
                     toInt(stamp.substr(10, 2)) * 60.0 + toInt(stamp.substr(12, 2)) +
                     toInt(stamp.substr(14, 6)) * 1e-6;
    double p[3], v[3];
    for (int k = 0; k < 3; ++k) {
      p[k] = fieldDouble(r, 20 + 25 * k, 25);
      v[k] = fieldDouble(r, 95 + 25 * k, 25);
    }
    if (eci) {
      double pe[3], ve[3];
      inertial_to_earth_fixed(greenwich_angle(t), p, v, pe, ve);
      pushPoint(out, t, pe, ve);
    } else {
      pushPoint(out, t, p, v);
    }
  }
  if (out.size() < 9) {
    ORV_REPORT("Fewer than 9 orbit points in " + path, REPORT_ERROR);
    return STATUS_READ_FAILED;
  }
  return STATUS_OK;
}

int read_palsar_leader_orbit(const std::string& path, OrbitRecords& out) {
  out = OrbitRecords{};
  int st;
  std::vector<char> d = readWhole(path, &st);
  if (st != 0) return st;
  const unsigned char* u = reinterpret_cast<const unsigned char*>(d.data());
  std::size_t o = 0, posRec = 0, dssRec = 0;
  bool havePos = false, haveDss = false;
  while (o + 12 <= d.size()) {
    const std::uint32_t len = ch2uint4(u + o + 8, kMsbFirst);
    if (len < 12 || o + len > d.size()) break;
    if (u[o + 5] == 30 && !havePos) {
      posRec = o;
      havePos = true;
    }
    if (u[o + 5] == 10 && !haveDss) {
      dssRec = o;
      haveDss = true;
    }
    o += len;
  }
  if (!havePos || posRec + 386 > d.size()) {
    ORV_REPORT("No platform position record in " + path, REPORT_ERROR);
    return STATUS_READ_FAILED;
  }
  bool vexcel = false;
  if (haveDss && dssRec + 1070 <= d.size())
    vexcel = field(d.data() + dssRec, 1046, 16).find("VEXCEL") != std::string::npos ||
             field(d.data() + dssRec, 1062, 8).find("VEXCEL") != std::string::npos;
  const char* r = d.data() + posRec;
  const std::size_t recLen = ch2uint4(u + posRec + 8, kMsbFirst);
  const int n = fieldInt(r, 140, 4);
  const int year = fieldInt(r, 144, 4), month = fieldInt(r, 148, 4), day = fieldInt(r, 152, 4);
  const int doy = fieldInt(r, 156, 4);
  const double sod = fieldDouble(r, 160, 22);
  if (n < 1 || 386 + static_cast<std::size_t>(n) * 132 > recLen) {
    ORV_REPORT("Bad number of orbit points in " + path, REPORT_ERROR);
    return STATUS_READ_FAILED;
  }
  const double first =
      (vexcel ? dayStart(year, 1, 1) + (doy - 1) * 86400.0 : dayStart(year, month, day)) + sod;
  if (recLen > 4082 && r[4082] == '1')
    ORV_REPORT("LEAP SECOND IS PRESENT IN THE STATE VECTORS TIMING", REPORT_ERROR);
  for (int i = 0; i < n; ++i) {
    double p[3], v[3];
    for (int k = 0; k < 3; ++k) {
      p[k] = fieldDouble(r, 386 + 132 * i + 22 * k, 22);
      v[k] = fieldDouble(r, 386 + 132 * i + 66 + 22 * k, 22);
    }
    pushPoint(out, first + i * kOrbitFileStep, p, v);
  }
  return STATUS_OK;
}

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
  return interp_orb_records(rec, t, t - (n - 1) / 2.0 * dt, dt, n, pos, vel);
}
