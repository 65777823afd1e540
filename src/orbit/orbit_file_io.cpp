#include "orbit/orbit_file_io.h"

#include <cmath>
#include <cstdio>

#include "base/status.h"
#include "diag/report.h"
#include "orbit/orbit_files.h"
#include "product/time_base.h"

namespace orbit_file_io {

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

namespace {
constexpr const char* kMonths = "JANFEBMARAPRMAYJUNJULAUGSEPOCTNOVDEC";
}  // namespace

// Seconds since 1985 of midnight of a civil date, through the date text
// "DD-MMM-YYYY 00:00:00.000000".
double dayStart(int year, int month, int day) {
  if (month < 1 || month > 12) month = 1;
  char text[64];
  std::snprintf(text, sizeof text, "%02d-%.3s-%04d 00:00:00.000000", day, kMonths + 3 * (month - 1),
                year);
  return ascii2sec85(text);
}


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

}  // namespace orbit_file_io
