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

void putF16(char* r, int off, double v) { putFormat(r, off, 16, "%16.7f", v); }

// File descriptor record head shared by the leader and the image file.
void fileDescriptorHead(char* r, const std::string& software, int fileNumber, const std::string& fileName) {
  putText(r, 12, 4, "A");
  putText(r, 16, 12, "CEOS-SAR-CCT");
  putText(r, 28, 4, " B B");
  putText(r, 32, 12, software);
  putInt(r, 44, 4, "%4ld", fileNumber);
  putText(r, 48, 16, fileName);
  putText(r, 64, 4, "FSEQ");
  putInt(r, 68, 8, "%8ld", 1);
  putInt(r, 76, 4, "%4ld", 4);
  putText(r, 80, 4, "FTYP");
  putInt(r, 84, 8, "%8ld", 5);
  putInt(r, 92, 4, "%4ld", 4);
  putText(r, 96, 4, "FLGT");
  putInt(r, 100, 8, "%8ld", 9);
  putInt(r, 108, 4, "%4ld", 4);
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

std::vector<char> buildErsLeader(const ErsLeaderInfo& in) {
  const int nVec = static_cast<int>(in.vectors.size());
  const int pprLength = 386 + 132 * nVec;
  const int facilityLength = 12288;
  const std::size_t total = 720 + 1886 + pprLength + 2 * facilityLength;
  std::vector<char> file(total, ' ');

  // File descriptor record.
  char* r = file.data();
  putCeosRecordHead(r, 1, kTypeFdr, 720);
  fileDescriptorHead(r, in.software, 1, in.mission + ".SAR.RAWLEAD");
  putInt(r, 180, 6, "%6ld", 1);
  putInt(r, 186, 6, "%6ld", 1886);
  putInt(r, 192, 6, "%6ld", 0);
  putInt(r, 198, 6, "%6ld", 0);
  putInt(r, 204, 6, "%6ld", 1);
  putInt(r, 210, 6, "%6ld", pprLength);
  for (int k = 0; k < 12; ++k) {  // attitude .. ground control points: none
    putInt(r, 216 + 12 * k, 6, "%6ld", 0);
    putInt(r, 222 + 12 * k, 6, "%6ld", 0);
  }
  putInt(r, 420, 6, "%6ld", 2);
  putInt(r, 426, 6, "%6ld", facilityLength);

  // Data set summary record.
  r = file.data() + kErsDssOffset;
  putCeosRecordHead(r, 2, kTypeDss, 1886);
  putInt(r, 12, 4, "%4ld", 1);
  putInt(r, 16, 4, "%4ld", 1);
  putText(r, 36, 32, in.sceneDesignator);
  putText(r, 68, 32, simCompactDateText(in.sceneCentreTime));
  putF16(r, 116, in.sceneCentreLat);
  putF16(r, 132, in.sceneCentreLon);
  putF16(r, 148, kAbsent);
  putText(r, 164, 16, in.ellipsoid);
  putF16(r, 180, in.semiMajorKm);
  putF16(r, 196, in.semiMinorKm);
  putF16(r, 212, 3.9860044);
  putF16(r, 244, 1082.28);
  putF16(r, 260, -2.3);
  putF16(r, 276, -0.2);
  putInt(r, 324, 8, "%08ld", in.centreLine);
  putInt(r, 332, 8, "%08ld", in.centrePixel);
  putF16(r, 340, in.sceneLengthKm);
  putF16(r, 356, in.sceneWidthKm);
  putText(r, 388, 4, "0001");
  putText(r, 396, 16, in.mission);
  putText(r, 412, 32, "   SAR- C-HR-IM-" + in.polarisation.substr(0, 2));
  putInt(r, 444, 8, "%8ld", in.orbitNumber);
  putFormat(r, 452, 8, "%8.3f", in.platformLat);
  putFormat(r, 460, 8, "%8.3f", in.platformLon);
  putFormat(r, 468, 8, "%8.3f", in.platformHeading);
  putFormat(r, 476, 8, "%8.3f", 90.0);
  putFormat(r, 484, 8, "%8.3f", in.incidenceDeg);
  putFormat(r, 492, 8, "%8.3f", in.radarFreqGHz);
  putFormat(r, 502, 16, "%16.9f", in.wavelength);
  putText(r, 518, 16, "LINEAR FM CHIRP");
  const double amplitude[5] = {1.0, 0.0, 0.0, 0.0, 0.0};
  const double phase[5] = {0.0, 0.0, in.chirpCoefficient, 0.0, 0.0};
  for (int k = 0; k < 5; ++k) putFormat(r, 534 + 16 * k, 16, "%16.7e", amplitude[k]);
  for (int k = 0; k < 5; ++k) putFormat(r, 614 + 16 * k, 16, "%16.7e", phase[k]);
  putInt(r, 694, 8, "%8ld", 29);
  putF16(r, 710, in.samplingRateMHz);
  putF16(r, 742, in.pulseLengthUs);
  putText(r, 762, 4, "NO");
  putInt(r, 798, 8, "%08ld", 5);
  putText(r, 806, 12, "UNIFORM IQ");
  putF16(r, 818, in.biasI);
  putF16(r, 834, in.biasQ);
  putF16(r, 850, kAbsent);
  putF16(r, 914, in.mechanicalBoresightDeg);
  putF16(r, 934, in.prf);
  putText(r, 998, 32, simCompactDateText(in.firstLineTime));
  putText(r, 1046, 16, in.facility);
  putText(r, 1062, 8, "SARSIM");
  putText(r, 1070, 8, "1.0");
  putText(r, 1110, 32, "SAR RAW SIGNAL DATA");
  for (int k = 0; k < 6; ++k) putF16(r, 1174 + 16 * k, kAbsent);
  putText(r, 1334, 16, "HDDT");
  putF16(r, 1350, kAbsent);
  putF16(r, 1366, kAbsent);
  for (int k = 0; k < 3; ++k) {
    putF16(r, 1414 + 16 * k, kAbsent);
    putF16(r, 1478 + 16 * k, kAbsent);
    putF16(r, 1542 + 16 * k, kAbsent);
    putF16(r, 1606 + 16 * k, kAbsent);
  }
  putText(r, 1526, 8, "INCREASE");
  putText(r, 1534, 8, "INCREASE");
  putText(r, 1670, 8, "RANGE");
  putText(r, 1678, 4, "NOT");
  putText(r, 1682, 4, "NOT");
  putF16(r, 1686, in.lineSpacing);
  putF16(r, 1702, in.pixelSpacing);
  putF16(r, 1766, in.firstRangeTimeMs);
  putF16(r, 1782, in.centreRangeTimeMs);
  putF16(r, 1798, in.lastRangeTimeMs);
  putText(r, 1814, 24, simDateText(in.firstLineTime));
  putText(r, 1838, 24, simDateText(in.centreLineTime));
  putText(r, 1862, 24, simDateText(in.lastLineTime));

  // Platform position record.
  r = file.data() + kErsPprOffset;
  putCeosRecordHead(r, 3, kTypePpr, pprLength);
  const CivilTime c = simCivil(in.firstVectorTime);
  putInt(r, 140, 4, "%04ld", nVec);
  putInt(r, 144, 4, "%4ld", c.year);
  putInt(r, 148, 4, "%04ld", c.month);
  putInt(r, 152, 4, "%4ld", c.day);
  putInt(r, 156, 4, "%04ld", simDayOfYear(c.year, c.month, c.day));
  const double sod = std::round((in.firstVectorTime - simSec85({c.year, c.month, c.day, 0, 0, 0.0})) * 1e6) / 1e6;
  putFormat(r, 160, 22, "%22.15E", sod);
  putFormat(r, 182, 22, "%22.15E", in.vectorInterval);
  putText(r, 204, 64, "Earth Centred Rotating");
  putFormat(r, 268, 22, "%22.15E", -9999.999999999998);
  for (int k = 0; k < 3; ++k) putF16(r, 290 + 16 * k, kAbsent);
  for (int v = 0; v < nVec; ++v) {
    const StateVector& sv = in.vectors[v];
    const double vals[6] = {sv.pos[0], sv.pos[1], sv.pos[2], sv.vel[0], sv.vel[1], sv.vel[2]};
    for (int k = 0; k < 6; ++k) putFormat(r, 386 + 132 * v + 22 * k, 22, "%22.15E", vals[k]);
  }

  // Facility related data records.
  for (int f = 0; f < 2; ++f) {
    r = file.data() + kErsPprOffset + pprLength + f * facilityLength;
    putCeosRecordHead(r, 4 + f, kTypeFacility, facilityLength);
    putText(r, 12, 64, "FACILITY RELATED DATA RECORD [ESA GENERAL TYPE]");
  }
  return file;
}

std::vector<char> buildErsImageDescriptor(const std::string& mission, const std::string& software, int records,
                                          int samples) {
  std::vector<char> d(kErsImageDescriptorSize, ' ');
  char* r = d.data();
  putCeosRecordHead(r, 1, kTypeFdr, kErsImageDescriptorSize);
  fileDescriptorHead(r, software, 2, mission + ".SAR.RAWIMGY");
  putInt(r, 180, 6, "%06ld", records);
  putInt(r, 186, 6, "%06ld", kErsDataPrefix + 2 * samples);
  putInt(r, 216, 4, "%4ld", 16);
  putInt(r, 220, 4, "%4ld", 1);
  putInt(r, 224, 4, "%4ld", 2);
  putInt(r, 232, 4, "%4ld", 1);
  putInt(r, 236, 8, "%08ld", records);
  putInt(r, 244, 4, "%4ld", 0);
  putInt(r, 248, 8, "%08ld", samples);
  putText(r, 256, 4, "0000");
  putInt(r, 260, 4, "%4ld", 0);
  putInt(r, 264, 4, "%4ld", 0);
  putText(r, 268, 4, "BSQ");
  putInt(r, 272, 2, "%2ld", 1);
  putInt(r, 274, 2, "%2ld", 1);
  putText(r, 276, 4, " 400");
  putInt(r, 280, 8, "%08ld", 2 * samples);
  putInt(r, 288, 4, "%4ld", 0);
  putInt(r, 292, 4, "%4ld", 1);
  const char* locators[5] = {"  13 4PB", "  49 2PB", "  45 4PB", "  21 4PB", "  29 4PB"};
  for (int k = 0; k < 5; ++k) putText(r, 296 + 8 * k, 8, locators[k]);
  putText(r, 400, 28, "COMPLEX UNSIGNED INTEGER");
  putText(r, 428, 4, "CI*2");
  putInt(r, 432, 4, "%4ld", 0);
  putInt(r, 436, 4, "%4ld", 0);
  putInt(r, 440, 8, "%8ld", 255);
  return d;
}

void buildErsDataRecord(char* rec, std::uint32_t sequence, std::uint32_t lineNumber, int samples,
                        std::uint16_t swstCode, std::uint16_t priCode, std::uint32_t formatCounter,
                        const unsigned char* iq) {
  const int length = kErsDataPrefix + 2 * samples;
  std::memset(rec, 0, kErsDataPrefix);
  putCeosRecordHead(rec, sequence, kTypeData, length);
  putBE32(rec + 12, lineNumber);
  putBE32(rec + 16, 1);
  // Instrument auxiliary data: sync bytes, format counter, window start
  // code, pulse repetition interval code, gain.
  rec[202] = static_cast<char>(0xAA);
  rec[208] = static_cast<char>(0xAA);
  putBE32(rec + 210, formatCounter);
  putBE16(rec + 214, swstCode);
  putBE16(rec + 216, priCode);
  rec[218] = 0x2c;
  rec[219] = 0x1e;
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
