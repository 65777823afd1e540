// Product recognition by fixed fields of the product files.
#include "ingest/product_types.h"

#include <cstring>
#include <fstream>

#include "base/status.h"
#include "diag/report.h"
#include "ingest/ceos/ceos_fields.h"
#include "product/roi.h"
#include "product/time_base.h"

namespace {

constexpr long kMphProductOffset = 9;        // value of PRODUCT=" in the MPH
constexpr std::size_t kMphProductBytes = 62;
constexpr long kSensingStartField = 349;     // ="<SENSING_START> as read for the region
constexpr long kSensingStartValue = 351;     // the SENSING_START value itself
constexpr std::size_t kMphDateBytes = 27;
constexpr long kSensingStopGap = 16;         // from the end of the start value to the stop value
constexpr long kLeaderMissionOffset = 1116;  // mission id in the data set summary
constexpr std::size_t kLeaderMissionBytes = 16;

std::string joined(const std::string& directory, const char* name) {
  if (directory.empty()) return name;
  const char last = directory.back();
  return directory + (last == '/' || last == '\\' ? "" : "/") + name;
}

// Reads count bytes at offset; false when the file cannot be opened or is shorter.
bool readFileBytes(const std::string& path, long offset, std::size_t count, std::string& bytes) {
  std::ifstream in(path, std::ios::binary);
  if (!in) return false;
  in.seekg(offset);
  bytes.assign(count, '\0');
  in.read(bytes.data(), static_cast<std::streamsize>(count));
  return in.gcount() == static_cast<std::streamsize>(count);
}

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

// ---- ERS -------------------------------------------------------------------------

std::string ErsTypes::leaderPath() const {
  for (const char* name : {"LEA_01.001", "lea_01.001"}) {
    std::string path = joined(directory_, name);
    if (std::ifstream(path, std::ios::binary)) return path;
  }
  return {};
}

int ErsTypes::leaderFieldIs(long offset, std::size_t bytes, const char* expected,
                            std::size_t count) const {
  const std::string leader = leaderPath();
  std::string value;
  if (leader.empty() || !readFileBytes(leader, offset, bytes, value)) return 0;
  return value.compare(0, count, expected, count) == 0 ? 1 : 0;
}

int ErsTypes::is_ers1() const { return leaderFieldIs(kLeaderMissionOffset, kLeaderMissionBytes, "ERS1", 4); }
int ErsTypes::is_ers2() const { return leaderFieldIs(kLeaderMissionOffset, kLeaderMissionBytes, "ERS2", 4); }

int ErsTypes::is_level0() const { return leaderFieldIs(1834, 3, "RAW", 3); }

int ErsTypes::is_deos(const std::string& orbit) const {
  std::string head;
  if (!readFileBytes(orbit, 0, 4, head)) return 0;
  return head == "@ODR" || head == "xODR" ? 1 : 0;
}

int ErsTypes::is_deos_ers1(const std::string& orbit) const {
  std::string tag;
  if (!readFileBytes(orbit, 4, 5, tag)) return 0;
  return tag == "ERS-1" ? 1 : 0;
}

int ErsTypes::is_deos_ers2(const std::string& orbit) const {
  std::string tag;
  if (!readFileBytes(orbit, 4, 5, tag)) return 0;
  return tag == "ERS-2" ? 1 : 0;
}

int ErsTypes::check_deos(const std::string& orbit) const {
  if (is_deos_ers1(orbit) && is_ers1()) return 1;
  if (is_deos_ers2(orbit) && is_ers2()) return 1;
  return 0;
}

int ErsTypes::find_type() const {
  if (is_ers1()) return 1;
  if (is_ers2()) return 2;
  if (is_deos()) return 3;
  return 0;
}

int ErsTypes::read_roi(ROI_Obj* roi) const {
  const std::string leader = leaderPath();
  if (leader.empty()) return 0;
  std::string first, last, prf, near, far, rate;
  if (!readFileBytes(leader, 2534, 24, first) || !readFileBytes(leader, 2582, 24, last) ||
      !readFileBytes(leader, 1654, 16, prf) || !readFileBytes(leader, 2486, 16, near) ||
      !readFileBytes(leader, 2518, 16, far) || !readFileBytes(leader, 1430, 16, rate))
    return 0;
  roi->SlowStartTime = ascii2sec85(first);
  roi->SlowTimeLength = ascii2sec85(last) - roi->SlowStartTime;
  roi->SlowTimeDelta = 1.0 / FtoDouble(prf.data(), 16);
  roi->FastStartTime = FtoDouble(near.data(), 16) / 1000.0;
  roi->FastTimeLength = FtoDouble(far.data(), 16) / 1000.0 - roi->FastStartTime;
  // Kept as the archive tool has it: this region serves time look-ups only.
  roi->FastTimeDelta = (1.0 / FtoDouble(rate.data(), 16)) * 1000000.0;
  roi->Lines = roundHalfAway(roi->SlowTimeLength / roi->SlowTimeDelta);
  roi->Samples = roundHalfAway(roi->FastTimeLength / roi->FastTimeDelta);
  return 1;
}

// ---- PALSAR ----------------------------------------------------------------------

int PalsarTypes::is_level0() const {
  std::string v;
  return readFileBytes(leader_, 1830, 11, v) && v == "UNPROCESSED" ? 1 : 0;
}

int PalsarTypes::is_ersdac() const {
  std::ifstream in(leader_, std::ios::binary);
  if (!in) {
    ORV_REPORT("File not opened!", REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  std::string v;
  if (!readFileBytes(leader_, 2606, 6, v)) {
    ORV_REPORT("File reading failed!", REPORT_ERROR);
    return STATUS_READ_FAILED;
  }
  return v == "VEXCEL" ? 1 : 0;
}

int PalsarTypes::is_scansar_wide1() const {
  std::string a, b;
  if (!readFileBytes(leader_, 1144, 2, a) || !readFileBytes(leader_, 1436, 2, b)) return 0;
  return a == "61" && b == "32" ? 1 : 0;
}

int PalsarTypes::polCount(int jaxaCode, int ersdacCount) const {
  if (is_ersdac() == 1) {
    std::string v;
    if (!readFileBytes(image_, 232, 4, v)) return 0;
    return ch2int(v.data(), 4) == ersdacCount ? 1 : 0;
  }
  std::string v;
  if (!readFileBytes(leader_, 1108, 4, v)) return 0;
  const char expected[5] = {' ', ' ', ' ', static_cast<char>('0' + jaxaCode), '\0'};
  return v == expected ? 1 : 0;
}

int PalsarTypes::is_singlepol() const { return polCount(1, 1); }
int PalsarTypes::is_doublepol() const { return polCount(2, 3); }
int PalsarTypes::is_quadpol() const { return polCount(4, 6); }

int PalsarTypes::find_type() const {
  if (is_singlepol()) return 1;
  if (is_doublepol()) return 2;
  if (is_quadpol()) return 3;
  if (is_scansar_wide1()) return 4;
  // A second look at the same test: never true here.
  if (is_scansar_wide1()) return 5;
  return 0;
}

int PalsarTypes::getPol() const {
  std::string v;
  if (!readFileBytes(image_, 772, 4, v)) return 4;
  const int tx = static_cast<unsigned char>(v[1]), rx = static_cast<unsigned char>(v[3]);
  if (tx == 0 && rx == 0) return 0;
  if (tx == 0 && rx == 1) return 1;
  if (tx == 1 && rx == 0) return 2;
  if (tx == 1 && rx == 1) return 3;
  return 4;
}

int PalsarTypes::get_ersdac_Pol(int channel) const {
  if (is_ersdac() != 1) return getPol();
  std::string v;
  if (!readFileBytes(image_, 16304, 2, v)) return 4;
  unsigned short value = 0;
  std::memcpy(&value, v.data(), 2);  // machine order
  if (is_doublepol()) {
    if (channel < 0 || channel > 1) return 4;
    if (value == 0) return channel;
    if (value == 1) return channel + 2;
    return 4;
  }
  if (is_quadpol()) {
    if (channel < 0 || channel > 3) return 4;
    if (value == 0) return channel;
    if (value == 1) return (channel + 2) % 4;
    return 4;
  }
  return 4;
}
