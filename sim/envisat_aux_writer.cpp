// ENVISAT auxiliary products of the simulator.
#include "sim/envisat_aux_writer.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <fstream>

#include "base/constants.h"

namespace {

constexpr int kMph = 1247, kSph = 378, kDsOffset = 1625;
constexpr double kPi = consts::kPi;

// Gaussian 4-bit quantiser levels of the positive half, in standard deviations.
constexpr double kHalfLevels[8] = {0.1284, 0.3881, 0.6568, 0.9423, 1.2562, 1.6180, 2.0690, 2.7326};

void putFloat(unsigned char* p, float f) {
  std::uint32_t v;
  std::memcpy(&v, &f, 4);
  asarPutBE32(p, v);
}
void putDouble(unsigned char* p, double d) {
  std::uint64_t v;
  std::memcpy(&v, &d, 8);
  for (int i = 0; i < 8; ++i) p[i] = static_cast<unsigned char>(v >> (56 - 8 * i));
}
void putText(std::string& s, std::size_t at, const std::string& text) { s.replace(at, text.size(), text); }

// Specific header of an auxiliary product: its name, then DS_OFFSET at 231
// and NUM_DSR at 305.
std::string auxSph(const std::string& descriptor, long records, long recordBytes) {
  std::string s(kSph, ' ');
  putText(s, 0, "SPH_DESCRIPTOR=\"" + descriptor + "\"\n");
  char b[128];
  std::snprintf(b, sizeof b, "DS_OFFSET=+%020d<bytes>\n", kDsOffset);
  putText(s, 221, b);
  std::snprintf(b, sizeof b, "NUM_DSR=+%010ld\n", records);
  putText(s, 297, b);
  std::snprintf(b, sizeof b, "DSR_SIZE=+%010ld<bytes>\n", recordBytes);
  putText(s, 320, b);
  s[kSph - 1] = '\n';
  return s;
}

int writeFile(const std::string& path, const std::string& head, const std::vector<unsigned char>& body,
              std::string& error) {
  std::ofstream out(path, std::ios::binary | std::ios::trunc);
  out.write(head.data(), std::streamsize(head.size()));
  out.write(reinterpret_cast<const char*>(body.data()), std::streamsize(body.size()));
  if (!out) {
    error = "cannot write " + path;
    return 5;
  }
  return 0;
}

std::string baseName(const std::string& path) { return path.substr(path.find_last_of('/') + 1); }

// MJD2000 day of a time since 1985 (8766 days from 1985 to 2000).
std::uint32_t mjdDay(double sec85) { return static_cast<std::uint32_t>(std::floor(sec85 / 86400.0) - 5478); }

}  // namespace

void asarPutBE32(unsigned char* p, std::uint32_t v) {
  p[0] = static_cast<unsigned char>(v >> 24), p[1] = static_cast<unsigned char>(v >> 16);
  p[2] = static_cast<unsigned char>(v >> 8), p[3] = static_cast<unsigned char>(v);
}
void asarPutBE16(unsigned char* p, unsigned v) {
  p[0] = static_cast<unsigned char>(v >> 8), p[1] = static_cast<unsigned char>(v);
}

double FbaqCodec::sigma(int code) { return 0.01 * std::pow(1.05, code); }

float FbaqCodec::level(int l, int code) {
  const double v = l >= 8 ? kHalfLevels[l - 8] : -kHalfLevels[7 - l];
  return static_cast<float>(v * sigma(code));
}

int FbaqCodec::codeFor(double s) {
  if (!(s > 0.0)) return 0;
  return std::clamp(static_cast<int>(std::lround(std::log(s / 0.01) / std::log(1.05))), 0, 255);
}

int FbaqCodec::nibbleFor(float v, int code) {
  const double x = std::fabs(v) / sigma(code);
  int k = 0;  // index of the nearest positive level
  while (k < 7 && x > 0.5 * (kHalfLevels[k] + kHalfLevels[k + 1])) ++k;
  // Level index 8 + k for v >= 0 has code k; 7 - k for v < 0 has code 8 + k.
  return v >= 0.0f ? k : 8 + k;
}

int FbaqCodec::lineBytes(int samples) {
  const int full = samples / 63;
  const int tail = samples % 63 ? samples - 63 * full + 1 : 0;
  return 64 * full + (tail + 1) / 2 * 2;
}

void FbaqCodec::encodeLine(const fcomplex* in, int samples, unsigned char* out) {
  std::memset(out, 0, std::size_t(lineBytes(samples)));
  for (int first = 0, block = 0; first < samples; first += 63, ++block) {
    const int n = std::min(63, samples - first);
    double power = 0.0;
    for (int k = 0; k < n; ++k) power += std::norm(in[first + k]);
    const int code = codeFor(std::sqrt(power / (2.0 * n)));
    unsigned char* p = out + 64 * block;
    p[0] = static_cast<unsigned char>(code);
    for (int k = 0; k < n; ++k)
      p[1 + k] = static_cast<unsigned char>((nibbleFor(in[first + k].real(), code) << 4) |
                                            nibbleFor(in[first + k].imag(), code));
  }
}

double asarSimDroopGain(int k) {
  const double* m = asar_sim::kDroopModel;
  const double T = asar_sim::kDroopTemperature;
  const double t = k * 1e6 / asar_sim::kSamplingHz;
  const double g = (m[0] * T + m[1]) * std::exp(-t / m[2]) + (m[3] * T + m[4]) * std::exp(-t / m[5]) + m[6] * T + m[7];
  return std::pow(10.0, g / 20.0);
}

std::string envisatDate(double sec85) {
  const double whole = std::floor(sec85);
  long us = std::lround((sec85 - whole) * 1e6);
  double base = whole;
  if (us >= 1000000) us -= 1000000, base += 1.0;
  const CivilTime c = simCivil(base);
  char b[64];
  std::snprintf(b, sizeof b, "%02d-%s-%04d %02d:%02d:%02d.%06ld", c.day, simMonthName(c.month), c.year, c.hour,
                c.minute, static_cast<int>(std::lround(c.second)), us);
  return b;
}

std::string envisatCompact(double sec85) {
  const CivilTime c = simCivil(std::floor(sec85));
  char b[32];
  std::snprintf(b, sizeof b, "%04d%02d%02d_%02d%02d%02d", c.year, c.month, c.day, c.hour, c.minute,
                static_cast<int>(std::lround(c.second)));
  return b;
}

std::string envisatAuxName(const std::string& prefix, double generation, double validStart, double validStop) {
  return prefix + envisatCompact(generation) + "_" + envisatCompact(validStart) + "_" + envisatCompact(validStop);
}

std::string envisatMph(const std::string& productName, double procTime, double sensingStart, double sensingStop) {
  std::string s(kMph, ' ');
  std::string name = productName;
  name.resize(62, ' ');
  putText(s, 0, "PRODUCT=\"" + name + "\"\n");
  putText(s, 73, "PROC_STAGE=N\n");
  putText(s, 225, "PROC_TIME=\"" + envisatDate(procTime) + "\"\n");
  putText(s, 336, "SENSING_START=\"" + envisatDate(sensingStart) + "\"\n");
  putText(s, 380, "SENSING_STOP=\"" + envisatDate(sensingStop) + "\"\n");
  s[kMph - 1] = '\n';
  return s;
}

int writeAsarIns(const std::string& path, double generation, double validStart, double validStop, std::string& error) {
  using namespace asar_sim;
  std::vector<unsigned char> r(kInsRecordBytes, 0);
  asarPutBE32(r.data(), mjdDay(generation));
  asarPutBE32(r.data() + 12, kInsRecordBytes);
  putFloat(r.data() + 16, kCarrierHz);
  putFloat(r.data() + 20, kSamplingHz);
  putFloat(r.data() + 69912, kRangeGateBias);
  for (int l = 0; l < 16; ++l)
    for (int b = 0; b < 256; ++b) {
      putFloat(r.data() + 74656 + 4 * (256 * l + b), FbaqCodec::level(l, b));
      putFloat(r.data() + 103328 + 4 * (256 * l + b), FbaqCodec::level(l, b));
    }
  // Rank tables by swath code 1..7: IM second rank, IM rank, AP second rank, AP rank.
  for (int c = 1; c <= 7; ++c) {
    asarPutBE16(r.data() + 161606 + 2 * c, 1023);
    asarPutBE16(r.data() + 161620 + 2 * c, unsigned(kRanks[c - 1]));
    asarPutBE16(r.data() + 161662 + 2 * c, unsigned(kApBurstEchoes[c - 1]));
    asarPutBE16(r.data() + 161676 + 2 * c, unsigned(kRanks[c - 1]));
    putFloat(r.data() + 161916 + 4 * c, kFirstAngles[c - 1]);
  }
  // Calibration pulse tables: 7 swaths x 2 polarisations x 32 complex values.
  for (int k = 0; k < 7 * 2 * 64; ++k)
    putFloat(r.data() + 162016 + 4 * k, static_cast<float>(std::cos(0.1 * k)));
  putFloat(r.data() + 171368, kDroopTemperature);
  for (int i = 0; i < 8; ++i) putDouble(r.data() + 171372 + 8 * i, kDroopModel[i]);
  const std::string head = envisatMph(baseName(path), generation, validStart, validStop) +
                           auxSph("ASA_INS_AX SPECIFIC HEADER", 1, kInsRecordBytes);
  return writeFile(path, head, r, error);
}

int writeAsarXca(const std::string& path, double generation, double validStart, double validStop, std::string& error) {
  using namespace asar_sim;
  std::vector<unsigned char> r(kXcaRecordBytes, 0);
  asarPutBE32(r.data(), mjdDay(generation));
  asarPutBE32(r.data() + 12, kXcaRecordBytes);
  for (int k = 0; k < 128; ++k) putFloat(r.data() + 16 + 4 * k, static_cast<float>(1000.0 + k));
  // Elevation patterns of the swaths IS1..IS7 and four polarisations: 201
  // points 0.05 degrees apart, the main lobe of a uniform aperture centred
  // on point 100, in dB, floored at -40 dB.
  for (int sw = 1; sw <= 7; ++sw)
    for (int pol = 0; pol < 4; ++pol)
      for (int p = 0; p < 201; ++p) {
        const double x = (p - 100) * 0.05 / 6.0;
        const double a = std::fabs(x) < 1e-12 ? 1.0 : std::fabs(std::sin(kPi * x) / (kPi * x));
        const double db = std::max(-40.0, 20.0 * std::log10(std::max(a, 1e-6)));
        putFloat(r.data() + ((pol + 4 * sw) * 201 + p) * 4 - 2424, static_cast<float>(db));
      }
  const std::string head = envisatMph(baseName(path), generation, validStart, validStop) +
                           auxSph("ASA_XCA_AX SPECIFIC HEADER", 1, kXcaRecordBytes);
  return writeFile(path, head, r, error);
}

int writeAsarXch(const std::string& path, double generation, double validStart, double validStop, std::string& error) {
  using namespace asar_sim;
  std::vector<unsigned char> r(kXchRecordBytes, 0);
  asarPutBE32(r.data(), mjdDay(generation));
  asarPutBE32(r.data() + 12, kXchRecordBytes);
  for (int k = 0; k < 128; ++k) putFloat(r.data() + 16 + 4 * k, static_cast<float>(0.03 * std::cos(0.2 * k)));
  const std::string head = envisatMph(baseName(path), generation, validStart, validStop) +
                           auxSph("ASA_XCH_AX SPECIFIC HEADER", 1, kXchRecordBytes);
  return writeFile(path, head, r, error);
}

int writeDorVor(const std::string& path, const SimOrbit& orbit, double generation, double start, double stop,
                int absoluteOrbit, std::string& error) {
  std::string records;
  const int count = static_cast<int>(std::floor((stop - start) / 60.0)) + 1;
  for (int i = 0; i < count; ++i) {
    const StateVector sv = orbit.at(start + 60.0 * i);
    char b[160];
    std::snprintf(b, sizeof b, "%s +.000000 %+06d %+012.3f %+012.3f %+012.3f %+012.6f %+012.6f %+012.6f      3\n",
                  envisatDate(sv.t).c_str(), absoluteOrbit, sv.pos[0], sv.pos[1], sv.pos[2], sv.vel[0], sv.vel[1],
                  sv.vel[2]);
    if (std::strlen(b) != 129) {
      error = "orbit record of " + path + " does not fit 129 bytes";
      return 5;
    }
    records += b;
  }
  const std::string head = envisatMph(baseName(path), generation, start, start + 60.0 * (count - 1)) +
                           auxSph("DORIS PRECISE ORBIT", count, 129);
  return writeFile(path, head, std::vector<unsigned char>(records.begin(), records.end()), error);
}
