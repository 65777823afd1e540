// Products, their acquisition times, and the search of auxiliary products
// valid at a scene's start.
#include "ingest/sar_product.h"

#include <dirent.h>

#include <cstdio>
#include <cstring>
#include <memory>
#include <vector>

#include "base/status.h"
#include "diag/ckerr.h"
#include "diag/report.h"
#include "ingest/product_files.h"
#include "ingest/product_types.h"
#include "product/antenna_pattern.h"
#include "product/roi.h"
#include "product/time_base.h"

namespace {

// Generation, validity start and stop of an auxiliary product name.
int parseAuxName(const std::string& name, double* generation, double* start, double* stop) {
  int v[18] = {};
  const int n = std::sscanf(name.c_str(),
                            "%*14s%4d%2d%2d_%2d%2d%2d_%4d%2d%2d_%2d%2d%2d_%4d%2d%2d_%2d%2d%2d", &v[0],
                            &v[1], &v[2], &v[3], &v[4], &v[5], &v[6], &v[7], &v[8], &v[9], &v[10],
                            &v[11], &v[12], &v[13], &v[14], &v[15], &v[16], &v[17]);
  if (n != 18) return STATUS_BAD_CONDITION;
  double t[3];
  for (int k = 0; k < 3; ++k) {
    const int* d = v + 6 * k;
    if (!dateToSec85(d[0], d[1], d[2], d[3], d[4], d[5], t[k])) return STATUS_BAD_CONDITION;
  }
  *generation = t[0];
  *start = t[1];
  *stop = t[2];
  return 0;
}

int parseDorName(const std::string& name, double* start, double* stop) {
  int v[12] = {};
  const int n = std::sscanf(name.c_str(), "%*12s-P%*d_%*d_%4d%2d%2d_%2d%2d%2d_%4d%2d%2d_%2d%2d%2d",
                            &v[0], &v[1], &v[2], &v[3], &v[4], &v[5], &v[6], &v[7], &v[8], &v[9],
                            &v[10], &v[11]);
  if (n != 12) return STATUS_BAD_CONDITION;
  if (!dateToSec85(v[0], v[1], v[2], v[3], v[4], v[5], *start)) return STATUS_BAD_CONDITION;
  if (!dateToSec85(v[6], v[7], v[8], v[9], v[10], v[11], *stop)) return STATUS_BAD_CONDITION;
  return 0;
}

struct DirCloser {
  void operator()(DIR* d) const { closedir(d); }
};
using DirHandle = std::unique_ptr<DIR, DirCloser>;

// The newest product of one ENVISAT type valid at time in a directory.
int searchAuxProduct(double time, const std::string& path, int (EnvisatTypes::*test)() const,
                     const char* notFound, std::string& found) {
  CheckedCall cc("searchAuxProduct()");
  DirHandle dir(path.empty() ? nullptr : opendir(path.c_str()));
  if (!dir) return STATUS_BAD_CONDITION;
  std::string best;
  double bestGeneration = 0.0;
  while (const dirent* entry = readdir(dir.get())) {
    const std::string name = entry->d_name;
    if (name == "." || name == "..") continue;
    const std::string full = path + "/" + name;
    if (!(EnvisatTypes(full).*test)()) continue;
    double generation = -1.0, start = -1.0, stop = -1.0;
    if (parseAuxName(name, &generation, &start, &stop) != 0) continue;
    if (!(start < time && time < stop)) continue;
    if (best.empty() || generation > bestGeneration) {
      best = full;
      bestGeneration = generation;
    }
  }
  if (best.empty())
    ORV_REPORT(notFound, REPORT_WARNING);
  else
    found = best;
  return STATUS_OK;
}

// Validity start (stop false) or stop of a named product through its parser.
template <class Parse>
int validityTime(const std::string& fileName, bool stop, double* t, Parse parse) {
  if (fileName.empty()) {
    ORV_REPORT(stop ? "File not set, cannot find stop time" : "File not set, cannot find start time",
               REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  double first = 0.0, last = 0.0;
  if (parse(&first, &last) != 0) return STATUS_BAD_CONDITION;
  *t = stop ? last : first;
  return 0;
}

}  // namespace

// ---- base ------------------------------------------------------------------------

int SAR_product::getTimeStop(double*) { return STATUS_BAD_CONDITION; }
int SAR_product::getTimeStart(double*) { return STATUS_BAD_CONDITION; }

int SAR_product::setfileName(const std::string& name) {
  if (name.empty()) return STATUS_BAD_CONDITION;
  fileName_ = name;
  return 0;
}

int SAR_product::getFileName(std::string& out) const {
  if (!fileName_.empty()) out = fileName_;
  return 0;
}

// ---- ENVISAT auxiliary products ------------------------------------------------------

int Envisat_AuxProduct::parseASAfilename(double* generation, double* start, double* stop) const {
  return parseAuxName(baseName(fileName_), generation, start, stop);
}

int Envisat_AuxProduct::getTimeStart(double* t) {
  return validityTime(fileName_, false, t, [this](double* start, double* stop) {
    double generation;
    return parseASAfilename(&generation, start, stop);
  });
}

int Envisat_AuxProduct::getTimeStop(double* t) {
  return validityTime(fileName_, true, t, [this](double* start, double* stop) {
    double generation;
    return parseASAfilename(&generation, start, stop);
  });
}

int Envisat_ASA_INS::getASA_INS(double time, const std::string& path) {
  return searchAuxProduct(time, path, &EnvisatTypes::is_ins, "ASA INS for current date or path not found",
                          fileName_);
}

int Envisat_ASA_XCH::getASA_XCH(double time, const std::string& path) {
  return searchAuxProduct(time, path, &EnvisatTypes::is_xch, "ASA XCH for current date or path not found",
                          fileName_);
}

int Envisat_ASA_XCA::getASA_XCA(double time, const std::string& path) {
  return searchAuxProduct(time, path, &EnvisatTypes::is_xca, "ASA XCA for current date or path not found",
                          fileName_);
}

int Envisat_ASA_XCA::readRgPattern(int swath, int polarisation, AntennaPattern_Obj* pattern) const {
  if (fileName_.empty() || pattern == nullptr) return 0;
  if (int st = pattern->getPatternENVI(fileName_, swath, polarisation); st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  return 0;
}

int Envisat_DorVor::parseOrbitName(double* start, double* stop) const {
  return parseDorName(baseName(fileName_), start, stop);
}

int Envisat_DorVor::getTimeStart(double* t) {
  return validityTime(fileName_, false, t, [this](double* a, double* b) { return parseOrbitName(a, b); });
}

int Envisat_DorVor::getTimeStop(double* t) {
  return validityTime(fileName_, true, t, [this](double* a, double* b) { return parseOrbitName(a, b); });
}

int Envisat_DorVor::getDorVor(double time, const std::string& path) {
  CheckedCall cc("Envisat_DorVor::getDorVor()");
  if (time < 0.0 || path.empty()) return STATUS_BAD_CONDITION;
  DirHandle dir(opendir(path.c_str()));
  if (!dir) return STATUS_BAD_CONDITION;
  const bool backslash = path.back() == '\\';
  while (const dirent* entry = readdir(dir.get())) {
    const std::string name = entry->d_name;
    if (name == "." || name == "..") continue;
    const std::string full = backslash ? path + name : path + "/" + name;
    if (!EnvisatTypes(full).is_dorvor()) continue;
    double start = -1.0, stop = -1.0;
    if (parseDorName(name, &start, &stop) != 0) continue;
    if (start < time && time < stop) {
      fileName_ = full;
      break;
    }
  }
  return STATUS_OK;
}

// ---- ENVISAT level 0 -------------------------------------------------------------

int Envisat_level0::getTimeStart(double* t) {
  if (fileName_.empty()) return STATUS_BAD_CONDITION;
  ROI_Obj roi;
  if (EnvisatTypes(fileName_).read_roi(&roi) != 1) return STATUS_BAD_CONDITION;
  *t = roi.SlowStartTime;
  return 0;
}

int Envisat_level0::getTimeStop(double* t) {
  if (fileName_.empty()) return STATUS_BAD_CONDITION;
  ROI_Obj roi;
  if (EnvisatTypes(fileName_).read_roi(&roi) != 1) return STATUS_BAD_CONDITION;
  *t = roi.SlowStartTime + roi.SlowTimeLength;
  return 0;
}

int Envisat_level0::getAuxFiles(int selector, const std::string& path) {
  CheckedCall cc("Envisat_level0::getAuxFiles()");
  double start = 0.0;
  if (int st = getTimeStart(&start); st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  enum Search { XCA, INS, XCH, DOR };
  static const std::vector<std::vector<Search>> plans = {
      {XCA, INS, XCH, DOR}, {XCA, INS, XCH}, {INS}, {XCA}, {XCH}, {DOR}};
  if (selector < 0 || selector >= static_cast<int>(plans.size())) return 0;
  for (const Search s : plans[static_cast<std::size_t>(selector)]) {
    int st = 0;
    switch (s) {
      case XCA: st = xca_.getASA_XCA(start, path); break;
      case INS: st = ins_.getASA_INS(start, path); break;
      case XCH: st = xch_.getASA_XCH(start, path); break;
      case DOR: st = dorvor_.getDorVor(start, path); break;
    }
    if (st != 0) {
      ORV_REPORT_CALLED_ERROR();
      return st;
    }
  }
  return 0;
}

int Envisat_level0::isAuxValid(int selector) const {
  // The orbit term is the base's validity, which is never true.
  const int orbitTerm = static_cast<const SAR_product&>(dorvor_).isValid();
  switch (selector) {
    case 0: return xca_.isValid() | ins_.isValid() | xch_.isValid() | orbitTerm;
    case 1: return xca_.isValid() | ins_.isValid() | xch_.isValid();
    case 2: return ins_.isValid();
    case 3: return xca_.isValid();
    case 4: return xch_.isValid();
    case 5: return orbitTerm;
    default: return 0;
  }
}
