// ERS level-0 products: acquisition times from the leader and the DEOS arc
// of the orbit archive valid at the scene's start.
#include "ingest/ers/ers_level0.h"

#include <cstdio>
#include <cstring>
#include <memory>

#include "base/status.h"
#include "diag/ckerr.h"
#include "diag/report.h"
#include "ingest/ers/ers_types.h"
#include "ingest/product_files.h"
#include "product/roi.h"

int Ers_DEOS::getTimeStop(double*) { return 0; }
int Ers_DEOS::getTimeStart(double*) { return 0; }

int Ers_DEOS::getDEOS(double time, int satellite, const std::string& path) {
  CheckedCall cc("Ers_DEOS::getDEOS()");
  if ((satellite != 0 && satellite != 1) || time < 0.0 || path.empty()) return STATUS_BAD_CONDITION;
  // The same list serves both satellites.
  const std::string list = path + "/ERS1/PRECISE/arclist";
  std::unique_ptr<std::FILE, int (*)(std::FILE*)> in(std::fopen(list.c_str(), "r"), &std::fclose);
  if (!in) {
    ORV_REPORT("File not opened!", REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  fileName_.clear();
  char line[99];
  int counted = 0;
  while (std::fgets(line, sizeof line, in.get())) {
    if (std::strlen(line) < 67) continue;
    if (counted++ < 22) continue;  // the list's head
    int y1, m1, d1, h1, mi1, s1, y2, m2, d2, h2, mi2;
    if (std::sscanf(line + 63, " %2d%2d%2d %2d:%2d:%2d", &y1, &m1, &d1, &h1, &mi1, &s1) != 6) continue;
    if (std::sscanf(line + 20, " %2d%2d%2d %2d:%2d", &y2, &m2, &d2, &h2, &mi2) != 5) continue;
    y1 += y1 > 85 ? 1900 : 2000;
    y2 += y2 > 85 ? 1900 : 2000;
    double begin = 0.0, end = 0.0;
    if (!dateToSec85(y1, m1, d1, h1, mi1, s1, begin)) return STATUS_BAD_CONDITION;
    if (!dateToSec85(y2, m2, d2, h2, mi2, 0, end)) return STATUS_BAD_CONDITION;
    if (!(begin < time && time < end)) continue;
    int arc = 0;
    if (std::sscanf(line, " %3d%*s", &arc) != 1) continue;
    char name[1100];
    std::snprintf(name, sizeof name, "%s%s%3.0d", path.c_str(),
                  satellite == 1 ? "/ERS2/PRECISE/ODR." : "/ERS1/PRECISE/ODR.", arc);
    std::string formed = name;
    for (std::size_t k = formed.size() >= 3 ? formed.size() - 3 : 0; k < formed.size(); ++k)
      if (formed[k] == ' ') formed[k] = '0';
    fileName_ = formed;
  }
  return STATUS_OK;
}

int Ers_level0::getTimeStart(double* t) {
  ROI_Obj roi;
  if (ErsTypes(fileName_).read_roi(&roi) != 1) return STATUS_BAD_CONDITION;
  *t = roi.SlowStartTime;
  return 0;
}

int Ers_level0::getTimeStop(double* t) {
  ROI_Obj roi;
  if (ErsTypes(fileName_).read_roi(&roi) != 1) return STATUS_BAD_CONDITION;
  *t = roi.SlowStartTime + roi.SlowTimeLength;
  return 0;
}

int Ers_level0::getAuxFiles(int selector, const std::string& path) {
  CheckedCall cc("Ers_level0::getAuxFiles()");
  if (selector != 3) return 0;
  const ErsTypes types(fileName_);
  ROI_Obj roi;
  if (types.read_roi(&roi) != 1) return STATUS_BAD_CONDITION;
  int satellite;
  if (types.is_ers1())
    satellite = 0;
  else if (types.is_ers2())
    satellite = 1;
  else
    return STATUS_BAD_CONDITION;
  const std::string tag = satellite == 0 ? "ERS1" : "ERS2";
  ORV_REPORT(tag + " image found, looking for orbit... ", REPORT_CHECKPOINT);
  if (int st = orbit_.getDEOS(roi.SlowStartTime, satellite, path); st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  ORV_REPORT(tag + " orbit found", REPORT_CHECKPOINT);
  return 0;
}

int Ers_level0::isAuxValid(int selector) const { return selector == 3 ? orbit_.isValid() : 0; }

