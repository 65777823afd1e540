#include "ingest/product_files.h"

#include <cstdio>
#include <fstream>

#include "product/time_base.h"

namespace {

constexpr const char* kMonths[12] = {"JAN", "FEB", "MAR", "APR", "MAY", "JUN",
                                     "JUL", "AUG", "SEP", "OCT", "NOV", "DEC"};

}  // namespace

bool readFileBytes(const std::string& path, long offset, std::size_t count, std::string& bytes) {
  std::ifstream in(path, std::ios::binary);
  if (!in) return false;
  in.seekg(offset);
  bytes.assign(count, '\0');
  in.read(bytes.data(), static_cast<std::streamsize>(count));
  return in.gcount() == static_cast<std::streamsize>(count);
}

std::string joinedPath(const std::string& directory, const char* name) {
  if (directory.empty()) return name;
  const char last = directory.back();
  return directory + (last == '/' || last == '\\' ? "" : "/") + name;
}

bool dateToSec85(int year, int month, int day, int hour, int minute, int second, double& out) {
  if (month < 1 || month > 12) return false;
  char text[64];
  std::snprintf(text, sizeof text, "%d-%3s-%d %d:%d:%d", day, kMonths[month - 1], year, hour, minute,
                second);
  out = ascii2sec85(text);
  return true;
}

std::string baseName(const std::string& path) {
  const auto cut = path.find_last_of("/\\");
  return cut == std::string::npos ? path : path.substr(cut + 1);
}
