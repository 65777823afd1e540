#pragma once
// File helpers shared by the orbit file readers.
#include <cstdio>
#include <memory>
#include <string>
#include <vector>

#include "orbit/orbit_files.h"

namespace orbit_file_io {

struct FileCloser {
  void operator()(std::FILE* f) const {
    if (f) std::fclose(f);
  }
};
using FilePtr = std::unique_ptr<std::FILE, FileCloser>;

FilePtr openForReading(const std::string& path);
// printf with one string argument.
std::string fmt(const char* format, const std::string& arg);
// Reads size bytes at offset; false on a short read.
bool readAt(std::FILE* f, long offset, void* dst, std::size_t size);
// Copy of a fixed-width text field.
std::string field(const char* bytes, int offset, int width);
double fieldDouble(const char* bytes, int offset, int width);
int fieldInt(const char* bytes, int offset, int width);
// "File reading failed! (path)" at error level; returns 4.
int reportReadFailed(const std::string& path);
// Start index of nine interpolation nodes around record i of count records.
int nineNodeStart(int i, int count);
// Index of the record nearest to t in ascending times.
int nearestRecord(const std::vector<double>& times, double t);
// Lagrange interpolation of one axis-set of nine nodes at one time.
void lagrange9(const double* pts, const double* times, double t, double out[3]);
// Seconds since 1985 of midnight of a civil date, through the date text
// "DD-MMM-YYYY 00:00:00.000000".
double dayStart(int year, int month, int day);
// The whole file; status 9 (reported) when it does not open, else 0.
std::vector<char> readWhole(const std::string& path, int* status);
// Appends one point to the records.
void pushPoint(OrbitRecords& out, double t, const double p[3], const double v[3]);

}  // namespace orbit_file_io
