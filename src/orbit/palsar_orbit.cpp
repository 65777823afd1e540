#include "orbit/palsar_orbit.h"

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

int read_palsar_leader_timing(const std::string& leader, double& firstTime,
                              std::string& stepText, double& step) {
  constexpr long kPositionRecord = 720 + 4096;
  FilePtr in = openForReading(leader);
  if (!in) {
    ORV_REPORT("File not opened! " + leader, REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  char record[206] = {};
  if (!readAt(in.get(), kPositionRecord, record, 204)) {
    ORV_REPORT("File reading failed! " + leader, REPORT_ERROR);
    return STATUS_READ_FAILED;
  }
  const int year = std::atoi(field(record, 144, 4).c_str());
  const int month = std::atoi(field(record, 148, 4).c_str());
  const int day = std::atoi(field(record, 152, 4).c_str());
  const double secondsOfDay = std::atof(field(record, 160, 22).c_str());
  stepText = field(record, 182, 22);
  step = std::atof(stepText.c_str());
  if (month < 1 || month > 12 || day < 1 || day > 31 || year < 1985) {
    ORV_REPORT("File reading failed! " + leader + " (state vector date)", REPORT_ERROR);
    return STATUS_READ_FAILED;
  }
  firstTime = dayStart(year, month, day) + secondsOfDay;
  return STATUS_OK;
}
