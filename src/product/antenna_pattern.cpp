#include "product/antenna_pattern.h"

#include <cmath>
#include <new>

#include "base/status.h"
#include "diag/report.h"
#include "product/acquisition_objects.h"
#include "product/buffer_io.h"
#include "product/byte_order.h"
#include "product/record_io.h"

namespace {

constexpr double kBig = 1e300;
// Data record of the external calibration product, as read for the patterns.
constexpr std::size_t kXcaRecordSize = 26552;
constexpr std::size_t kPatternTable = 12760;   // first pattern entry
constexpr std::size_t kPatternEntry = 804;     // 201 floats in dB
constexpr std::size_t kBoresightTable = 760;   // boresight elevation by swath
constexpr int kPatternPoints = 201;

}  // namespace

AntennaPattern_Obj::AntennaPattern_Obj() { createElementsVector(3); }
AntennaPattern_Obj::AntennaPattern_Obj(const AntennaPattern_Obj& o) : AntennaPattern_Obj() {
  o.clone(this);
}
AntennaPattern_Obj& AntennaPattern_Obj::operator=(const AntennaPattern_Obj& o) {
  if (this != &o) o.clone(this);
  return *this;
}

int AntennaPattern_Obj::createBuffers() {
  if (PatternSamples <= 0) return 0;
  try {
    Pattern.assign(static_cast<std::size_t>(PatternSamples), 0.0f);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Memory allocation failed for the antenna pattern", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  refreshParameters();
  setAllocationFlag(true);
  return 0;
}

int AntennaPattern_Obj::destroyBuffers() {
  Pattern.clear();
  return 0;
}

void AntennaPattern_Obj::refreshParameters() {
  addElementDouble("StartAngle", &StartAngle, 1, -kBig, kBig, true);
  addElementDouble("DeltaAngle", &DeltaAngle, 1, -kBig, kBig, true);
  addElementInt("PatternSamples", &PatternSamples, 1, 0, 10000, false);
  setAllocationFlag(true);
}

int AntennaPattern_Obj::writehdr(const std::string& file) {
  writeAuxiliaryFile(file, 1, "AntennaPattern");
  return 0;
}

int AntennaPattern_Obj::writehdr() {
  patternFile.NrOfPixelsPerLine = PatternSamples;
  patternFile.NrOfLinesPerImage = 1;
  patternFile.RowPrefix = 0;
  patternFile.CellType = FLOAT32;
  if (patternFile.write_hdr() != 0) {
    ORV_REPORT_CALLED_ERROR();
    return STATUS_WRITE_FAILED;
  }
  writeAuxiliaryFile(patternFile.filename + ".hdr", 1, "AntennaPattern");
  return 0;
}

int AntennaPattern_Obj::readhdr(const std::string& file) {
  // A read may bring a different count: the array follows it.
  const auto readDocument = [&] {
    if (readAuxiliaryFile(file, 1, "AntennaPattern")) return 0;
    ProfileKeyReader r(file, "AntennaPattern");
    r.required("StartAngle", &StartAngle);
    r.required("DeltaAngle", &DeltaAngle);
    r.optional("PatternSamples", &PatternSamples);
    return r.status();
  };
  const int status = readDocument();
  if (status != 0) return status;
  if (file.size() > 4) {
    const std::string raster = file.substr(0, file.size() - 4);
    DataFile layout;
    if (layout.read_hdr(raster) == 0) {
      patternFile = layout;
      patternFile.filename = raster;
      PatternSamples = layout.NrOfPixelsPerLine;
    }
  }
  return 0;
}

void AntennaPattern_Obj::clone(AntennaPattern_Obj* t) const {
  if (!t || t == this) return;
  t->StartAngle = StartAngle;
  t->DeltaAngle = DeltaAngle;
  t->PatternSamples = PatternSamples;
  t->patternFile = patternFile;
  t->Pattern = Pattern;
}

int AntennaPattern_Obj::getPatternENVI(const std::string& file, int swath, int polarisation) {
  std::vector<unsigned char> record;
  const int status = readAsarAuxRecord(file, kXcaRecordSize, record);
  if (status != 0) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  const long entry = static_cast<long>(swath) + 4L * polarisation;
  if (swath < 0 || polarisation < 0 ||
      kPatternTable + kPatternEntry * static_cast<std::size_t>(entry + 1) > kXcaRecordSize) {
    ORV_REPORT("Antenna pattern entry outside the table of " + file, REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  PatternSamples = kPatternPoints;
  if (createBuffers() != 0) return STATUS_NO_MEMORY;
  const unsigned char* values = &record[kPatternTable + kPatternEntry * static_cast<std::size_t>(entry)];
  for (int i = 0; i < kPatternPoints; ++i)
    Pattern[static_cast<std::size_t>(i)] =
        static_cast<float>(std::pow(10.0, ch2float4(values + 4 * i, 'm') / 20.0));
  StartAngle = ch2float4(&record[kBoresightTable + 4 * static_cast<std::size_t>(swath)], 'm') - 5.0;
  DeltaAngle = 0.05;
  return 0;
}

int AntennaPattern_Obj::getPatternArray(float* buffer) {
  if (buffer == nullptr) return STATUS_BAD_PARAMETER;
  if (Pattern.empty() || Pattern[0] == 0.0f) {
    if (PatternSamples <= 0) {
      ORV_REPORT("No antenna pattern samples", REPORT_ERROR);
      return STATUS_BAD_PARAMETER;
    }
    BufferIO io{.file = &patternFile, .first_column = 0, .columns = PatternSamples, .first_row = 0,
                 .rows = 1, .memory_type = FLOAT32};
    int status = io.readbuffer(buffer);
    patternFile.close();
    if (status != 0) {
      ORV_REPORT_CALLED_ERROR();
      return status;
    }
    Pattern.assign(buffer, buffer + PatternSamples);
    return 0;
  }
  for (std::size_t i = 0; i < Pattern.size(); ++i) buffer[i] = Pattern[i];
  return 0;
}

int AntennaPattern_Obj::WritePatternArray() {
  if (PatternSamples <= 0 || static_cast<int>(Pattern.size()) < PatternSamples) {
    ORV_REPORT("No antenna pattern samples to write", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  patternFile.NrOfPixelsPerLine = PatternSamples;
  patternFile.NrOfLinesPerImage = 1;
  patternFile.RowPrefix = 0;
  patternFile.HeaderOffset = 0;
  patternFile.CellType = FLOAT32;
  BufferIO io{.file = &patternFile, .first_column = 0, .columns = PatternSamples, .first_row = 0,
               .rows = 1, .memory_type = FLOAT32};
  int status = io.writebuffer(Pattern.data());
  const int closeStatus = patternFile.close();
  if (status == 0) status = closeStatus;
  if (status != 0) ORV_REPORT_CALLED_ERROR();
  return status;
}
