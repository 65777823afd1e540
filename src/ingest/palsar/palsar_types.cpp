// Recognition of ALOS PALSAR products by fixed fields of the leader and the
// image file.
#include "ingest/palsar/palsar_types.h"

#include <cstring>
#include <fstream>

#include "base/status.h"
#include "diag/report.h"
#include "ingest/ceos/ceos_fields.h"
#include "ingest/palsar/palsar_ceos_layout.h"
#include "ingest/product_files.h"

namespace {

namespace dss = palsar_leader::dss;

// A field of the record at recordStart; false when the file is short.
bool readField(const std::string& path, long recordStart, CeosField field, std::string& value) {
  return readFileBytes(path, fileOffset(recordStart, field), static_cast<std::size_t>(field.width),
                       value);
}

bool readLeader(const std::string& leader, CeosField field, std::string& value) {
  return readField(leader, palsar_leader::kDataSetSummary, field, value);
}

}  // namespace

int PalsarTypes::is_level0() const {
  std::string v;
  return readLeader(leader_, dss::kProcessingLevel, v) && v == "UNPROCESSED" ? 1 : 0;
}

int PalsarTypes::is_ersdac() const {
  std::ifstream in(leader_, std::ios::binary);
  if (!in) {
    ORV_REPORT("File not opened!", REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  std::string v;
  if (!readLeader(leader_, dss::kErsdacFacility, v)) {
    ORV_REPORT("File reading failed!", REPORT_ERROR);
    return STATUS_READ_FAILED;
  }
  return v == "VEXCEL" ? 1 : 0;
}

int PalsarTypes::is_scansar_wide1() const {
  std::string a, b;
  if (!readLeader(leader_, dss::kSensorMode, a) || !readLeader(leader_, dss::kBeam, b)) return 0;
  return a == "61" && b == "32" ? 1 : 0;
}

int PalsarTypes::polCount(int jaxaCode, int ersdacCount) const {
  if (is_ersdac() == 1) {
    std::string v;
    if (!readField(image_, 0, palsar_image::descriptor::kChannels, v)) return 0;
    return ch2int(v.data(), palsar_image::descriptor::kChannels.width) == ersdacCount ? 1 : 0;
  }
  std::string v;
  if (!readLeader(leader_, dss::kChannelCount, v)) return 0;
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
  if (!readField(image_, palsar_image::kFirstSignalRecord, palsar_image::signal::kPolarisation, v)) return 4;
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
  if (!readField(image_, 0, palsar_image::descriptor::kChannelOrder, v)) return 4;
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
