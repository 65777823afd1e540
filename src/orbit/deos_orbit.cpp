#include "orbit/deos_orbit.h"

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

