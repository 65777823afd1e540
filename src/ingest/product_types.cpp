// Recognition of ENVISAT products by fixed fields of their main product
// header.
#include "ingest/product_types.h"

#include <cstring>
#include <fstream>

#include "base/status.h"
#include "diag/report.h"
#include "ingest/product_files.h"
#include "product/roi.h"
#include "product/time_base.h"

namespace {

constexpr long kMphProductOffset = 9;        // value of PRODUCT=" in the MPH
constexpr std::size_t kMphProductBytes = 62;
constexpr long kSensingStartField = 349;     // ="<SENSING_START> as read for the region
constexpr long kSensingStartValue = 351;     // the SENSING_START value itself
constexpr std::size_t kMphDateBytes = 27;
constexpr long kSensingStopGap = 16;         // from the end of the start value to the stop value

bool startsWith(const std::string& value, const char* prefix) {
  return value.compare(0, std::strlen(prefix), prefix) == 0;
}

// Sensing start and stop of an MPH: 27 bytes at `at`, then 27 bytes 16 further on.
bool readSensingTimes(const std::string& path, long at, double& start, double& stop) {
  std::string a, b;
  if (!readFileBytes(path, at, kMphDateBytes, a)) return false;
  if (!readFileBytes(path, at + long(kMphDateBytes) + kSensingStopGap, kMphDateBytes, b)) return false;
  start = ascii2sec85(a);
  stop = ascii2sec85(b);
  return true;
}

}  // namespace

// ---- ENVISAT ---------------------------------------------------------------------

int EnvisatTypes::productStartsWith(const char* prefix) const {
  std::string value;
  if (!readFileBytes(fileName_, kMphProductOffset, kMphProductBytes, value)) return 0;
  return startsWith(value, prefix) ? 1 : 0;
}

int EnvisatTypes::is_aps() const { return productStartsWith("ASA_APS"); }
int EnvisatTypes::is_app() const { return productStartsWith("ASA_APP"); }
int EnvisatTypes::is_apm() const { return productStartsWith("ASA_APM"); }
int EnvisatTypes::is_apc() const { return productStartsWith("ASA_APC"); }
int EnvisatTypes::is_aph() const { return productStartsWith("ASA_APH"); }
int EnvisatTypes::is_apv() const { return productStartsWith("ASA_APV"); }
int EnvisatTypes::is_ims() const { return productStartsWith("ASA_IMS"); }
int EnvisatTypes::is_im0() const { return productStartsWith("ASA_IM__0"); }
int EnvisatTypes::is_wss() const { return productStartsWith("ASA_WSS"); }
int EnvisatTypes::is_wsm() const { return productStartsWith("ASA_WSM"); }
int EnvisatTypes::is_ws0() const { return productStartsWith("ASA_WS__0"); }
int EnvisatTypes::is_dorvor() const { return productStartsWith("DOR_VOR"); }
int EnvisatTypes::is_dorpor() const { return productStartsWith("DOR_POR"); }
int EnvisatTypes::is_xca() const { return productStartsWith("ASA_XCA"); }
int EnvisatTypes::is_xch() const { return productStartsWith("ASA_XCH"); }
int EnvisatTypes::is_ins() const { return productStartsWith("ASA_INS"); }

int EnvisatTypes::find_type() const {
  using Test = int (EnvisatTypes::*)() const;
  static constexpr Test tests[] = {
      &EnvisatTypes::is_aps, &EnvisatTypes::is_app, &EnvisatTypes::is_apm,
      &EnvisatTypes::is_apc, &EnvisatTypes::is_aph, &EnvisatTypes::is_apv,
      &EnvisatTypes::is_ims, &EnvisatTypes::is_im0, &EnvisatTypes::is_wss,
      &EnvisatTypes::is_wsm, &EnvisatTypes::is_ws0, &EnvisatTypes::is_dorvor,
      &EnvisatTypes::is_dorpor, &EnvisatTypes::is_xca, &EnvisatTypes::is_xch,
      &EnvisatTypes::is_ins};
  for (int k = 0; k < 16; ++k)
    if ((this->*tests[k])()) return k + 1;
  return 0;
}

int EnvisatTypes::read_roi(ROI_Obj* roi) const {
  double start = 0.0, stop = 0.0;
  if (!readSensingTimes(fileName_, kSensingStartField, start, stop)) return 0;
  roi->SlowStartTime = start;
  roi->SlowTimeLength = stop - start;
  roi->Lines = -1;
  roi->Samples = -1;
  roi->SlowTimeDelta = -1.0;
  roi->FastStartTime = -1.0;
  roi->FastTimeLength = -1.0;
  roi->FastTimeDelta = -1.0;
  return 1;
}

int EnvisatTypes::check_dorvor(const std::string& orbit) const {
  const int type = find_type();
  if (type < 1 || type > 11) return 0;
  std::string text;
  if (!readFileBytes(fileName_, kSensingStartValue, kMphDateBytes, text)) return 0;
  const double productStart = ascii2sec85(text);
  double orbitStart = 0.0, orbitStop = 0.0;
  if (!readSensingTimes(orbit, kSensingStartValue, orbitStart, orbitStop)) return 0;
  return orbitStart < productStart && productStart < orbitStop ? 1 : 0;
}
