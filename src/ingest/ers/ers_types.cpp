// Recognition of ERS products by fixed fields of their CEOS leader, and of
// DEOS orbit arcs by their head.
#include "ingest/ers/ers_types.h"

#include <cmath>
#include <fstream>

#include "ingest/ceos/ceos_fields.h"
#include "ingest/ers/ers_ceos_layout.h"
#include "ingest/product_files.h"
#include "product/roi.h"
#include "product/time_base.h"

namespace {

namespace dss = ers_leader::dss;

// File offset of a field of the data set summary.
constexpr long summaryField(CeosField field) {
  return fileOffset(ers_leader::kDataSetSummary, field);
}

// Reads a data set summary field of the leader; false when it is short.
bool readSummary(const std::string& leader, CeosField field, std::string& value) {
  return readFileBytes(leader, summaryField(field), static_cast<std::size_t>(field.width), value);
}

}  // namespace

std::string ErsTypes::leaderPath() const {
  for (const char* name : {"LEA_01.001", "lea_01.001"}) {
    std::string path = joinedPath(directory_, name);
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

int ErsTypes::is_ers1() const {
  return leaderFieldIs(summaryField(dss::kMission), dss::kMission.width, "ERS1", 4);
}
int ErsTypes::is_ers2() const {
  return leaderFieldIs(summaryField(dss::kMission), dss::kMission.width, "ERS2", 4);
}

int ErsTypes::is_level0() const {
  return leaderFieldIs(summaryField(dss::kProductLevel), dss::kProductLevel.width, "RAW", 3);
}

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
  if (!readSummary(leader, dss::kFirstLineTime, first) ||
      !readSummary(leader, dss::kLastLineTime, last) || !readSummary(leader, dss::kPrf, prf) ||
      !readSummary(leader, dss::kFirstRangeTimeMs, near) ||
      !readSummary(leader, dss::kLastRangeTimeMs, far) ||
      !readSummary(leader, dss::kSamplingRateMHz, rate))
    return 0;
  roi->SlowStartTime = ascii2sec85(first);
  roi->SlowTimeLength = ascii2sec85(last) - roi->SlowStartTime;
  roi->SlowTimeDelta = 1.0 / FtoDouble(prf.data(), dss::kPrf.width);
  roi->FastStartTime = FtoDouble(near.data(), dss::kFirstRangeTimeMs.width) / 1000.0;
  roi->FastTimeLength =
      FtoDouble(far.data(), dss::kLastRangeTimeMs.width) / 1000.0 - roi->FastStartTime;
  // Kept as the archive tool has it: this region serves time look-ups only.
  roi->FastTimeDelta = (1.0 / FtoDouble(rate.data(), dss::kSamplingRateMHz.width)) * 1000000.0;
  // Damaged times or rates give counts no scene has: the leader is refused.
  const double lines = roi->SlowTimeLength / roi->SlowTimeDelta;
  const double samples = roi->FastTimeLength / roi->FastTimeDelta;
  if (!(std::fabs(lines) < 1e9) || !(std::fabs(samples) < 1e9)) return 0;
  roi->Lines = roundHalfAway(lines);
  roi->Samples = roundHalfAway(samples);
  return 1;
}
