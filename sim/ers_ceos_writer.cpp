#include "sim/ers_ceos_writer.h"

#include <cmath>
#include <cstdio>
#include <cstring>
#include <stdexcept>

namespace {

constexpr double kAbsent = -9999999.9999999;
const unsigned char kTypeFdr[4] = {0x3f, 0xc0, 0x12, 0x12};
const unsigned char kTypeDss[4] = {0x0a, 0x0a, 0x1f, 0x14};
const unsigned char kTypePpr[4] = {0x0a, 0x1e, 0x1f, 0x14};
const unsigned char kTypeFacility[4] = {0x0a, 0xc8, 0x1f, 0x32};
const unsigned char kTypeData[4] = {0x32, 0x0a, 0x1f, 0x14};
const unsigned char kTypeVolume[4] = {0xc0, 0xc0, 0x12, 0x12};
const unsigned char kTypeFilePointer[4] = {0xdb, 0xc0, 0x12, 0x12};
const unsigned char kTypeText[4] = {0x12, 0x3f, 0x12, 0x12};
const unsigned char kTypeNull[4] = {0xc0, 0xc0, 0x3f, 0x12};

void putF16(char* r, CeosField field, double v) { putFormat(r, field, "%16.7f", v); }

// File descriptor record head shared by the leader and the image file.
void fileDescriptorHead(char* r, const std::string& software, int fileNumber, const std::string& fileName) {
  putText(r, ceos_descriptor::kAsciiFlag, "A");
  putText(r, ceos_descriptor::kFormatDocument, "CEOS-SAR-CCT");
  putText(r, ceos_descriptor::kFormatRevision, " B B");
  putText(r, ceos_descriptor::kSoftwareVersion, software);
  putInt(r, ceos_descriptor::kFileNumber, "%4ld", fileNumber);
  putText(r, ceos_descriptor::kFileName, fileName);
  putText(r, ceos_descriptor::kSequenceFlag, "FSEQ");
  putInt(r, ceos_descriptor::kSequenceLocation, "%8ld", 1);
  putInt(r, ceos_descriptor::kSequenceWidth, "%4ld", 4);
  putText(r, ceos_descriptor::kCodeFlag, "FTYP");
  putInt(r, ceos_descriptor::kCodeLocation, "%8ld", 5);
  putInt(r, ceos_descriptor::kCodeWidth, "%4ld", 4);
  putText(r, ceos_descriptor::kLengthFlag, "FLGT");
  putInt(r, ceos_descriptor::kLengthLocation, "%8ld", 9);
  putInt(r, ceos_descriptor::kLengthWidth, "%4ld", 4);
}

}  // namespace

void putBE32(char* p, std::uint32_t v) {
  p[0] = static_cast<char>(v >> 24);
  p[1] = static_cast<char>(v >> 16);
  p[2] = static_cast<char>(v >> 8);
  p[3] = static_cast<char>(v);
}

void putBE16(char* p, std::uint16_t v) {
  p[0] = static_cast<char>(v >> 8);
  p[1] = static_cast<char>(v);
}

void putCeosRecordHead(char* rec, std::uint32_t sequence, const unsigned char type[4], std::uint32_t length) {
  putBE32(rec, sequence);
  std::memcpy(rec + 4, type, 4);
  putBE32(rec + 8, length);
}

void putText(char* rec, int offset, int width, const std::string& text) {
  if (static_cast<int>(text.size()) > width)
    throw std::length_error("CEOS field at offset " + std::to_string(offset) + " too narrow for '" + text + "'");
  std::memset(rec + offset, ' ', width);
  std::memcpy(rec + offset, text.data(), text.size());
}

void putFormat(char* rec, int offset, int width, const char* format, double value) {
  char buf[128];
  const int n = std::snprintf(buf, sizeof buf, format, value);
  if (n > width)
    throw std::length_error("CEOS field at offset " + std::to_string(offset) + " too narrow for '" + buf + "'");
  std::memset(rec + offset, ' ', width);
  std::memcpy(rec + offset + (width - n), buf, n);
}

void putInt(char* rec, int offset, int width, const char* format, long value) {
  char buf[64];
  const int n = std::snprintf(buf, sizeof buf, format, value);
  if (n > width)
    throw std::length_error("CEOS field at offset " + std::to_string(offset) + " too narrow for '" + buf + "'");
  std::memset(rec + offset, ' ', width);
  std::memcpy(rec + offset + (width - n), buf, n);
}

void putText(char* rec, CeosField field, const std::string& text) {
  putText(rec, field.offset, field.width, text);
}

void putFormat(char* rec, CeosField field, const char* format, double value) {
  putFormat(rec, field.offset, field.width, format, value);
}

void putInt(char* rec, CeosField field, const char* format, long value) {
  putInt(rec, field.offset, field.width, format, value);
}

std::vector<char> buildErsLeader(const ErsLeaderInfo& in) {
  namespace fdr = ers_leader::fdr;
  namespace dss = ers_leader::dss;
  namespace ppr = ers_leader::ppr;
  const int nVec = static_cast<int>(in.vectors.size());
  const int pprLength = ppr::length(nVec);
  const int facilityLength = ers_leader::kFacilityLength;
  const std::size_t total = ers_leader::kFileDescriptorLength + ers_leader::kDataSetSummaryLength +
                            pprLength + 2 * facilityLength;
  std::vector<char> file(total, ' ');

  // File descriptor record.
  char* r = file.data() + ers_leader::kFileDescriptor;
  putCeosRecordHead(r, 1, kTypeFdr, ers_leader::kFileDescriptorLength);
  fileDescriptorHead(r, in.software, 1, in.mission + ".SAR.RAWLEAD");
  putInt(r, fdr::kSummaryCount, "%6ld", 1);
  putInt(r, fdr::kSummaryLength, "%6ld", ers_leader::kDataSetSummaryLength);
  putInt(r, fdr::kMapProjectionCount, "%6ld", 0);
  putInt(r, fdr::kMapProjectionLength, "%6ld", 0);
  putInt(r, fdr::kPositionCount, "%6ld", 1);
  putInt(r, fdr::kPositionLength, "%6ld", pprLength);
  for (int k = 0; k < fdr::kOtherKinds; ++k) {  // attitude .. ground control points: none
    putInt(r, fdr::kOtherCount.element(k, fdr::kOtherStride), "%6ld", 0);
    putInt(r, fdr::kOtherLength.element(k, fdr::kOtherStride), "%6ld", 0);
  }
  putInt(r, fdr::kFacilityCount, "%6ld", 2);
  putInt(r, fdr::kFacilityLength, "%6ld", facilityLength);

  // Data set summary record.
  r = file.data() + ers_leader::kDataSetSummary;
  putCeosRecordHead(r, 2, kTypeDss, ers_leader::kDataSetSummaryLength);
  putInt(r, dss::kSequence, "%4ld", 1);
  putInt(r, dss::kSarChannel, "%4ld", 1);
  putText(r, dss::kSceneDesignator, in.sceneDesignator);
  putText(r, dss::kSceneCentreTime, simCompactDateText(in.sceneCentreTime));
  putF16(r, dss::kSceneCentreLat, in.sceneCentreLat);
  putF16(r, dss::kSceneCentreLon, in.sceneCentreLon);
  putF16(r, dss::kSceneCentreHeading, kAbsent);
  putText(r, dss::kEllipsoid, in.ellipsoid);
  putF16(r, dss::kSemiMajorKm, in.semiMajorKm);
  putF16(r, dss::kSemiMinorKm, in.semiMinorKm);
  putF16(r, dss::kEarthMass, 3.9860044);
  putF16(r, dss::kJ2, 1082.28);
  putF16(r, dss::kJ3, -2.3);
  putF16(r, dss::kJ4, -0.2);
  putInt(r, dss::kCentreLine, "%08ld", in.centreLine);
  putInt(r, dss::kCentrePixel, "%08ld", in.centrePixel);
  putF16(r, dss::kSceneLengthKm, in.sceneLengthKm);
  putF16(r, dss::kSceneWidthKm, in.sceneWidthKm);
  putText(r, dss::kChannelCount, "0001");
  putText(r, dss::kMission, in.mission);
  putText(r, dss::kSensorId, "   SAR- C-HR-IM-" + in.polarisation.substr(0, 2));
  putInt(r, dss::kOrbitNumber, "%8ld", in.orbitNumber);
  putFormat(r, dss::kPlatformLat, "%8.3f", in.platformLat);
  putFormat(r, dss::kPlatformLon, "%8.3f", in.platformLon);
  putFormat(r, dss::kPlatformHeading, "%8.3f", in.platformHeading);
  putFormat(r, dss::kClockAngle, "%8.3f", 90.0);
  putFormat(r, dss::kIncidence, "%8.3f", in.incidenceDeg);
  putFormat(r, dss::kRadarFrequencyGHz, "%8.3f", in.radarFreqGHz);
  putFormat(r, dss::kWavelength, "%16.9f", in.wavelength);
  putText(r, dss::kPulseCode, "LINEAR FM CHIRP");
  const double amplitude[dss::kPulseCoefficients] = {1.0, 0.0, 0.0, 0.0, 0.0};
  const double phase[dss::kPulseCoefficients] = {0.0, 0.0, in.chirpCoefficient, 0.0, 0.0};
  for (int k = 0; k < dss::kPulseCoefficients; ++k) {
    putFormat(r, dss::kPulseAmplitude.element(k, dss::kPulseCoefficientStride), "%16.7e",
              amplitude[k]);
  }
  for (int k = 0; k < dss::kPulseCoefficients; ++k)
    putFormat(r, dss::kPulsePhase.element(k, dss::kPulseCoefficientStride), "%16.7e", phase[k]);
  putInt(r, dss::kChirpExtractionIndex, "%8ld", 29);
  putF16(r, dss::kSamplingRateMHz, in.samplingRateMHz);
  putF16(r, dss::kPulseLengthUs, in.pulseLengthUs);
  putText(r, dss::kBasebandConversion, "NO");
  putInt(r, dss::kQuantisationBits, "%08ld", 5);
  putText(r, dss::kQuantiser, "UNIFORM IQ");
  putF16(r, dss::kBiasI, in.biasI);
  putF16(r, dss::kBiasQ, in.biasQ);
  putF16(r, dss::kGainImbalance, kAbsent);
  putF16(r, dss::kBoresight, in.mechanicalBoresightDeg);
  putF16(r, dss::kPrf, in.prf);
  putText(r, dss::kFirstLineCompact, simCompactDateText(in.firstLineTime));
  putText(r, dss::kFacility, in.facility);
  putText(r, dss::kProcessingSystem, "SARSIM");
  putText(r, dss::kProcessingVersion, "1.0");
  putText(r, dss::kProductType, "SAR RAW SIGNAL DATA");
  for (int k = 0; k < dss::kProcessingRealCount; ++k)
    putF16(r, dss::kProcessingReals.element(k, 16), kAbsent);
  putText(r, dss::kDataInputSource, "HDDT");
  putF16(r, dss::kUnsetA, kAbsent);
  putF16(r, dss::kUnsetB, kAbsent);
  for (int k = 0; k < 3; ++k)
    for (const CeosField& group : dss::kUnsetGroups)
      putF16(r, group.element(k, dss::kUnsetGroupStride), kAbsent);
  putText(r, dss::kPixelTimeDirection, "INCREASE");
  putText(r, dss::kLineTimeDirection, "INCREASE");
  putText(r, dss::kLineContent, "RANGE");
  putText(r, dss::kClutterLock, "NOT");
  putText(r, dss::kAutofocus, "NOT");
  putF16(r, dss::kLineSpacing, in.lineSpacing);
  putF16(r, dss::kPixelSpacing, in.pixelSpacing);
  putF16(r, dss::kFirstRangeTimeMs, in.firstRangeTimeMs);
  putF16(r, dss::kCentreRangeTimeMs, in.centreRangeTimeMs);
  putF16(r, dss::kLastRangeTimeMs, in.lastRangeTimeMs);
  putText(r, dss::kFirstLineTime, simDateText(in.firstLineTime));
  putText(r, dss::kCentreLineTime, simDateText(in.centreLineTime));
  putText(r, dss::kLastLineTime, simDateText(in.lastLineTime));

  // Platform position record.
  r = file.data() + ers_leader::kPlatformPosition;
  putCeosRecordHead(r, 3, kTypePpr, pprLength);
  const CivilTime c = simCivil(in.firstVectorTime);
  putInt(r, ppr::kVectorCount, "%04ld", nVec);
  putInt(r, ppr::kYear, "%4ld", c.year);
  putInt(r, ppr::kMonth, "%04ld", c.month);
  putInt(r, ppr::kDay, "%4ld", c.day);
  putInt(r, ppr::kDayOfYear, "%04ld", simDayOfYear(c.year, c.month, c.day));
  const double sod = std::round((in.firstVectorTime - simSec85({c.year, c.month, c.day, 0, 0, 0.0})) * 1e6) / 1e6;
  putFormat(r, ppr::kSecondsOfDay, "%22.15E", sod);
  putFormat(r, ppr::kInterval, "%22.15E", in.vectorInterval);
  putText(r, ppr::kReferenceSystem, "Earth Centred Rotating");
  putFormat(r, ppr::kGreenwichAngle, "%22.15E", -9999.999999999998);
  for (int k = 0; k < 3; ++k) putF16(r, ppr::kPositionErrors.element(k, ppr::kPositionErrorStride), kAbsent);
  for (int v = 0; v < nVec; ++v) {
    const StateVector& sv = in.vectors[v];
    const double vals[6] = {sv.pos[0], sv.pos[1], sv.pos[2], sv.vel[0], sv.vel[1], sv.vel[2]};
    const CeosField vector = ppr::kVectorComponent.element(v, ppr::kVectorStride);
    for (int k = 0; k < 6; ++k)
      putFormat(r, vector.element(k, ppr::kComponentStride), "%22.15E", vals[k]);
  }

  // Facility related data records.
  for (int f = 0; f < 2; ++f) {
    r = file.data() + ers_leader::kPlatformPosition + pprLength + f * facilityLength;
    putCeosRecordHead(r, 4 + f, kTypeFacility, facilityLength);
    putText(r, ers_leader::facility::kTitle, "FACILITY RELATED DATA RECORD [ESA GENERAL TYPE]");
  }
  return file;
}

std::vector<char> buildErsImageDescriptor(const std::string& mission, const std::string& software, int records,
                                          int samples) {
  namespace ids = ers_image::descriptor;
  std::vector<char> d(kErsImageDescriptorSize, ' ');
  char* r = d.data();
  putCeosRecordHead(r, 1, kTypeFdr, kErsImageDescriptorSize);
  fileDescriptorHead(r, software, 2, mission + ".SAR.RAWIMGY");
  putInt(r, ids::kRecordCount, "%06ld", records);
  putInt(r, ids::kRecordLength, "%06ld", kErsDataPrefix + 2 * samples);
  putInt(r, ids::kBitsPerSample, "%4ld", 16);
  putInt(r, ids::kSamplesPerGroup, "%4ld", 1);
  putInt(r, ids::kBytesPerGroup, "%4ld", 2);
  putInt(r, ids::kChannels, "%4ld", 1);
  putInt(r, ids::kLines, "%08ld", records);
  putInt(r, ids::kBorderPixels, "%4ld", 0);
  putInt(r, ids::kSamples, "%08ld", samples);
  putText(r, ids::kBorderRight, "0000");
  putInt(r, ids::kTopBorder, "%4ld", 0);
  putInt(r, ids::kBottomBorder, "%4ld", 0);
  putText(r, ids::kInterleave, "BSQ");
  putInt(r, ids::kRecordsPerLine, "%2ld", 1);
  putInt(r, ids::kRecordsPerChannel, "%2ld", 1);
  putText(r, ids::kPrefixBytes, " 400");
  putInt(r, ids::kDataBytes, "%08ld", 2 * samples);
  putInt(r, ids::kSuffixBytes, "%4ld", 0);
  putInt(r, ids::kRepeatFlag, "%4ld", 1);
  const char* locators[5] = {"  13 4PB", "  49 2PB", "  45 4PB", "  21 4PB", "  29 4PB"};
  for (int k = 0; k < 5; ++k) putText(r, ids::kLocators.element(k, ids::kLocatorStride), locators[k]);
  putText(r, ids::kDataFormat, "COMPLEX UNSIGNED INTEGER");
  putText(r, ids::kDataFormatCode, "CI*2");
  putInt(r, ids::kLeftFill, "%4ld", 0);
  putInt(r, ids::kRightFill, "%4ld", 0);
  putInt(r, ids::kMaximumValue, "%8ld", 255);
  return d;
}

void buildErsDataRecord(char* rec, std::uint32_t sequence, std::uint32_t lineNumber, int samples,
                        std::uint16_t swstCode, std::uint16_t priCode, std::uint32_t formatCounter,
                        const unsigned char* iq) {
  namespace data = ers_image::data;
  const int length = kErsDataPrefix + 2 * samples;
  std::memset(rec, 0, kErsDataPrefix);
  putCeosRecordHead(rec, sequence, kTypeData, length);
  putBE32(rec + data::kLineNumber.offset, lineNumber);
  putBE32(rec + data::kImageRecord.offset, 1);
  // Instrument auxiliary data: sync bytes, format counter, window start
  // code, pulse repetition interval code, gain.
  rec[data::kSyncA.offset] = static_cast<char>(0xAA);
  rec[data::kSyncB.offset] = static_cast<char>(0xAA);
  putBE32(rec + data::kFormatCounter.offset, formatCounter);
  putBE16(rec + data::kWindowStartCode.offset, swstCode);
  putBE16(rec + data::kPriCode.offset, priCode);
  rec[data::kGainA.offset] = 0x2c;
  rec[data::kGainB.offset] = 0x1e;
  std::memcpy(rec + kErsDataPrefix, iq, 2 * static_cast<std::size_t>(samples));
}

std::vector<char> buildErsVolumeDirectory(const std::string& mission, const std::string& facility, int orbitNumber,
                                          double firstLineTime, int records, int samples) {
  std::vector<char> v(4 * 360, ' ');
  const std::string date = simCompactDateText(firstLineTime).substr(0, 16);
  char* r = v.data();
  putCeosRecordHead(r, 1, kTypeVolume, 360);
  putText(r, 12, 4, "A");
  putText(r, 16, 12, "CCB-CCT-0002");
  putText(r, 28, 4, "E A");
  putText(r, 32, 12, "SARSIM 1.0");
  putText(r, 44, 16, "");
  putText(r, 60, 16, "SIMULATED");
  putText(r, 76, 16, date);
  putText(r, 112, 36, " 1 1 1 1   1   1");
  putText(r, 168, 16, facility);
  putInt(r, 212, 4, "%4ld", 2);
  putInt(r, 216, 4, "%4ld", 4);
  putInt(r, 220, 4, "%4ld", 1);
  // File pointers: leader and image file.
  const char* names[2] = {".SAR.RAWLEAD", ".SAR.RAWIMGY"};
  for (int k = 0; k < 2; ++k) {
    r = v.data() + 360 * (k + 1);
    putCeosRecordHead(r, 2 + k, kTypeFilePointer, 360);
    putText(r, 12, 4, "A");
    putInt(r, 16, 4, "%4ld", k + 1);
    putText(r, 20, 16, mission + names[k]);
    putText(r, 36, 28, k == 0 ? "SARLEADER FILE" : "IMAGERY OPTIONS FILE");
    putText(r, 64, 4, k == 0 ? "SARL" : "IMOP");
    putText(r, 68, 28, "MIXED BINARY AND ASCII");
    putText(r, 96, 4, "MBAA");
    putInt(r, 100, 8, "%8ld", k == 0 ? 5 : records + 1);
    putInt(r, 108, 8, "%8ld", k == 0 ? 720 : 412 + 2 * samples);
    putInt(r, 116, 8, "%8ld", k == 0 ? 12288 : 412 + 2 * samples);
    putText(r, 124, 12, k == 0 ? "VARIABLE LEN" : "FIXED LENGTH");
    putText(r, 136, 4, k == 0 ? "VARE" : "FIXD");
  }
  r = v.data() + 3 * 360;
  putCeosRecordHead(r, 4, kTypeText, 360);
  putText(r, 12, 4, "A");
  putText(r, 16, 40, "PRODUCT:" + std::string(mission == "ERS1" ? "ERS-1" : "ERS-2") + ".SAR.RAW");
  char line[80];
  std::snprintf(line, sizeof line, "ORBIT %5d DATE  %s", orbitNumber, simDateText(firstLineTime).substr(0, 20).c_str());
  putText(r, 136, 60, line);
  return v;
}

std::vector<char> buildErsNullVolume(const std::string& facility) {
  std::vector<char> v(360, ' ');
  char* r = v.data();
  putCeosRecordHead(r, 1, kTypeNull, 360);
  putText(r, 12, 4, "A");
  putText(r, 16, 12, "CCB-CCT-0002");
  putText(r, 28, 4, "E A");
  putText(r, 32, 12, "SARSIM 1.0");
  putText(r, 168, 16, facility);
  putInt(r, 212, 4, "%4ld", 0);
  putInt(r, 216, 4, "%4ld", 1);
  return v;
}

std::vector<char> buildDeosOdr(const std::string& satellite, bool xodr, int arcNumber, std::int32_t headerTime,
                               std::int32_t firstTime, const std::vector<OdrPoint>& points) {
  const int n = static_cast<int>(points.size());
  std::vector<char> f(32 + 16 * static_cast<std::size_t>(n), ' ');
  std::memcpy(f.data(), xodr ? "xODR" : "@ODR", 4);
  putText(f.data(), 4, 8, satellite);
  putBE32(f.data() + 12, static_cast<std::uint32_t>(headerTime));
  putBE32(f.data() + 16, 35000);
  putBE32(f.data() + 20, static_cast<std::uint32_t>(arcNumber));
  putBE32(f.data() + 24, static_cast<std::uint32_t>(n));
  putBE32(f.data() + 28, static_cast<std::uint32_t>(arcNumber));
  const double scale = xodr ? 1e7 : 1e6;
  for (int i = 0; i < n; ++i) {
    char* p = f.data() + 32 + 16 * i;
    double lon = std::remainder(points[i].lonDeg, 360.0);  // (-180, 180], as the archive arcs
    putBE32(p, static_cast<std::uint32_t>(firstTime + 60 * i));
    putBE32(p + 4, static_cast<std::uint32_t>(static_cast<std::int32_t>(std::llround(points[i].latDeg * scale))));
    putBE32(p + 8, static_cast<std::uint32_t>(static_cast<std::int32_t>(std::llround(lon * scale))));
    putBE32(p + 12, static_cast<std::uint32_t>(static_cast<std::int32_t>(std::llround(points[i].height * 1000.0))));
  }
  return f;
}

std::string buildArclist(const std::vector<ArcEntry>& arcs) {
  // The head: 22 lines as long as the arc lines, which readers skip by count.
  std::string out;
  auto head = [&out](std::string s) {
    s.resize(79, s.empty() ? ' ' : (s.back() == '-' ? '-' : ' '));
    out += s + "\n";
  };
  head("DEOS PRECISE ORBITS - SIMULATED ARCHIVE");
  head("---------------------------------------");
  head(" Arc  Begin        End             Rep  Ver                Begin of validity");
  for (int k = 3; k < 22; ++k) head(std::string(79, k % 2 ? '-' : ' ').replace(0, 1, "#"));
  for (const ArcEntry& a : arcs) {
    std::string line(80, ' ');
    auto put = [&line](int col, const std::string& s) { line.replace(col, s.size(), s); };
    auto stamp = [](double t, bool seconds) {
      const CivilTime c = simCivil(t + 1e-6);
      char b[32];
      if (seconds)
        std::snprintf(b, sizeof b, " %02d%02d%02d %02d:%02d:%02d", c.year % 100, c.month, c.day, c.hour, c.minute,
                      static_cast<int>(c.second));
      else
        std::snprintf(b, sizeof b, " %02d%02d%02d %02d:%02d", c.year % 100, c.month, c.day, c.hour, c.minute);
      return std::string(b);
    };
    char num[8];
    std::snprintf(num, sizeof num, "%4d", a.number);
    put(0, num);
    put(5, stamp(a.start, false));
    put(20, stamp(a.end, false));
    put(36, " 35  1.0");
    put(63, stamp(a.start, true));
    while (!line.empty() && line.back() == ' ') line.pop_back();
    out += line + "\n";
  }
  return out;
}
