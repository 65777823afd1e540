// Moves a product file with its companion description files.
#include <sys/stat.h>

#include <cstdio>
#include <filesystem>

#include "base/status.h"
#include "diag/environment.h"

namespace {

namespace fs = std::filesystem;

bool exists(const std::string& path) {
  std::error_code ec;
  return fs::exists(path, ec);
}

void removeWritable(const std::string& path) {
  ::chmod(path.c_str(), 0700);
  std::remove(path.c_str());
}

bool moveFile(const std::string& from, const std::string& to) {
  std::error_code ec;
  fs::rename(from, to, ec);
  return !ec;
}

bool copyFile(const std::string& from, const std::string& to) {
  std::error_code ec;
  fs::copy_file(from, to, fs::copy_options::overwrite_existing, ec);
  return !ec;
}

}  // namespace

void moveFileSet(const std::string& source, const std::string& target, bool withCompanions) {
  if (exists(source)) {
    removeWritable(target);
    if (!moveFile(source, target) && copyFile(source, target)) std::remove(source.c_str());
  }
  if (!withCompanions) return;
  for (const char* suffix : {"_hdr", ".hdr", ".sml", ".shp", ".shx"}) {
    const std::string from = source + suffix;
    const std::string to = target + suffix;
    const std::string name = suffix;
    if (!exists(from)) {
      if (name == "_hdr") traceWrite("Not found : %s\n", from.c_str());
      continue;
    }
    if (name == "_hdr") removeWritable(to);
    if (moveFile(from, to)) continue;
    if (copyFile(from, to)) continue;
    if (name == ".hdr" || name == ".sml")
      TESV_FATAL(EC_COMPANION_NOT_MOVED, "cannot move " + from + " to " + to);
  }
}
