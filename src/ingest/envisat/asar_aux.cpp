// ASAR auxiliary readers and the FBAQ decoders.
#include "ingest/envisat/asar_aux.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <new>

#include "base/constants.h"
#include "base/status.h"
#include "diag/report.h"
#include "orbit/doris_orbit.h"
#include "product/acquisition_objects.h"
#include "product/byte_order.h"

namespace {

int fail(const std::string& message, int status, int line, const char* function) {
  orv_add_report(message, REPORT_ERROR, line, function, __FILE__);
  return status;
}
#define AUX_FAIL(message, status) fail((message), (status), __LINE__, __func__)
#define AUX_CALLED(status) \
  (orv_add_report("Called function returned ERROR", REPORT_ERROR_CALL_TREE, __LINE__, __func__, __FILE__), (status))

// 4-bit sign and magnitude code to level index: 0..7 give 8..15, 8..15 give 7..0.
constexpr int levelOf(int code) { return code < 8 ? code + 8 : 15 - code; }

// Offsets into the [level][code] tables of the high and low nibble of a data byte.
struct NibbleOffsets {
  std::array<std::uint16_t, 256> hi{}, lo{};
  constexpr NibbleOffsets() {
    for (int d = 0; d < 256; ++d) {
      hi[d] = static_cast<std::uint16_t>(levelOf(d >> 4) * kFbaqCodes);
      lo[d] = static_cast<std::uint16_t>(levelOf(d & 15) * kFbaqCodes);
    }
  }
};
constexpr NibbleOffsets kNibbles;

// Levels of the noise decoder, by level index.
constexpr float kNoiseLevels[16] = {-0.05906f, -0.051f, -0.043f, -0.035f, -0.0275f, -0.02f,
                                    -0.012f,   -0.004f, 0.004f,  0.012f,  0.02f,    0.0275f,
                                    0.035f,    0.043f,  0.051f,  0.05906f};

int recordOf(const char* path, long size, std::vector<unsigned char>& record) {
  if (path == nullptr) return AUX_FAIL("File not opened! (no file name)", STATUS_NOT_OPENED);
  if (int st = readAsarAuxRecord(path, std::size_t(size), record); st != 0) return AUX_CALLED(st);
  return 0;
}

}  // namespace

FbaqTables& fbaq_tables() {
  static FbaqTables tables;
  return tables;
}

int LUTfbaq_f(const char* insPath, float* tableQ, float* tableI) {
  std::vector<unsigned char> r;
  if (int st = recordOf(insPath, kInsRecordBytes, r); st != 0) return st;
  FbaqTables& t = fbaq_tables();
  for (int k = 0; k < kFbaqLevels * kFbaqCodes; ++k) {
    t.Q[std::size_t(k)] = ch2float4(r.data() + ins::kTableQ + 4 * k, kMsbFirst);
    t.I[std::size_t(k)] = ch2float4(r.data() + ins::kTableI + 4 * k, kMsbFirst);
  }
  if (tableQ) std::memcpy(tableQ, t.Q.data(), sizeof t.Q);
  if (tableI) std::memcpy(tableI, t.I.data(), sizeof t.I);
  return 0;
}

int fbaq_line_bytes(int samples) {
  const int full = samples / 63;
  const int tail = samples % 63 ? samples - 63 * full + 1 : 0;
  return 64 * full + (tail + 1) / 2 * 2;
}

int fbaq_decode84_f(const unsigned char* data, float* out, int bytes, int samples, int factor,
                    int* floats, int* lines) {
  if (factor < 1) factor = 1;
  samples = (samples + factor - 1) / factor;
  const int lineBytes = fbaq_line_bytes(samples);
  if (lineBytes <= 0 || bytes % lineBytes != 0) {
    if (asar_reports_on()) ORV_REPORT(" window length and packet size do not match!", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  const int count = bytes / lineBytes;
  const int full = samples / 63, tailSamples = samples - 63 * full;
  const float* tI = fbaq_tables().I.data();
  const float* tQ = fbaq_tables().Q.data();
  float* o = out;
  for (int l = 0; l < count; ++l) {
    const unsigned char* p = data + std::size_t(l) * std::size_t(lineBytes);
    for (int b = 0; b <= full; ++b, p += 64) {
      // The last block holds only the samples left; a padding byte that
      // rounds it to an even length is never decoded.
      const int n = b < full ? 63 : tailSamples;
      if (n == 0) break;  // whole blocks only: no tail block, no code byte to read
      const float* ci = tI + p[0];
      const float* cq = tQ + p[0];
      for (int k = 0; k < n; ++k) {
        const unsigned d = p[1 + k];
        o[0] = ci[kNibbles.hi[d]];
        o[1] = cq[kNibbles.lo[d]];
        o += 2;
      }
    }
  }
  if (floats) *floats = static_cast<int>(o - out);
  if (lines) *lines = count;
  return 0;
}

int fbaq_decode84fe(const unsigned char* data, float* out, int bytes, int samples, int factor,
                    int* floats, int* lines) {
  if (factor < 1) factor = 1;
  samples = (samples + factor - 1) / factor;
  const int lineBytes = (samples + 1) / 2 * 2;
  if (lineBytes <= 0 || bytes % lineBytes != 0) {
    if (asar_reports_on()) ORV_REPORT(" window length and packet size do not match!", REPORT_WARNING);
    return STATUS_BAD_CONDITION;
  }
  const int count = bytes / lineBytes;
  float* o = out;
  for (int l = 0; l < count; ++l) {
    const unsigned char* p = data + std::size_t(l) * std::size_t(lineBytes);
    for (int k = 0; k < samples; ++k, o += 2) {
      o[0] = kNoiseLevels[levelOf(p[k] >> 4)];
      o[1] = kNoiseLevels[levelOf(p[k] & 15)];
    }
  }
  if (floats) *floats = static_cast<int>(o - out);
  if (lines) *lines = count;
  return 0;
}

int getDROOPgain(const char* insPath, float* gain, int count) {
  std::vector<unsigned char> r;
  if (int st = recordOf(insPath, kInsRecordBytes, r); st != 0) return st;
  const float fs = ch2float4(r.data() + ins::kSampling, kMsbFirst);
  const float T = ch2float4(r.data() + ins::kDroopTemperature, kMsbFirst);
  float m[8];
  for (int i = 0; i < 8; ++i) m[i] = static_cast<float>(ch2double8(r.data() + ins::kDroopModel + 8 * i, kMsbFirst));
  const float a1 = m[0], b1 = m[1], tau1 = m[2], a2 = m[3], b2 = m[4], tau2 = m[5], a3 = m[6], b3 = m[7];
  if (!(fs > 0.0f) || tau1 == 0.0f || tau2 == 0.0f)
    return AUX_FAIL("Bad sampling frequency or droop model in " + std::string(insPath), STATUS_BAD_PARAMETER);
  const float c1 = a1 * T + b1, c2 = a2 * T + b2, c3 = a3 * T + b3;
  for (int k = 0; k < count; ++k) {
    const float t = static_cast<float>(k) * 1000000.0f / fs;  // microseconds
    const float g = c1 * std::exp(-t / tau1) + c2 * std::exp(-t / tau2) + c3;  // dB
    gain[k] = static_cast<float>(std::pow(10.0, g / 20.0));
  }
  return 0;
}

int asainspar(const char* insPath, sarpar* par, int mode, const int* swathCodes, int swaths) {
  std::vector<unsigned char> r;
  if (int st = recordOf(insPath, kInsRecordBytes, r); st != 0) return st;
  long rankTable = ins::kImRank, secondTable = ins::kImSecondRank;
  int base = 0;
  if (isApMode(mode)) {
    rankTable = ins::kApRank, secondTable = ins::kApSecondRank;
  } else if (mode == ASAR_WS || mode == ASAR_GM) {
    // Sub-swath codes 15..19 stand in these tables as 1..5.
    rankTable = ins::kWsRank, secondTable = ins::kWsSecondRank, base = 14;
  }
  for (int s = 0; s < swaths; ++s) {
    const int index = swathCodes[s] - base;
    if (index < 0 || index > 7)
      return AUX_FAIL("Swath code " + std::to_string(swathCodes[s]) + " outside the rank tables of " +
                          insPath,
                      STATUS_BAD_PARAMETER);
    par[s].Sampling_frequency = ch2float4(r.data() + ins::kSampling, kMsbFirst);
    par[s].Carrier_frequency = ch2float4(r.data() + ins::kCarrier, kMsbFirst);
    par[s].Range_gate_bias = ch2float4(r.data() + ins::kRangeGateBias, kMsbFirst);
    par[s].Swath_rank = static_cast<int>(ch2uint2(r.data() + rankTable + 2 * index, kMsbFirst));
    par[s].secondRank = static_cast<int>(ch2uint2(r.data() + secondTable + 2 * index, kMsbFirst));
  }
  return 0;
}

int xca_pattern_db(const char* xca, int polarisation, int swathNumber, int point, float* value) {
  const long at = (long(polarisation + 4 * swathNumber) * kPatternPoints + point) * 4 - 2424;
  if (at < 0 || at + 4 > kXcaPatternBytes)
    return AUX_FAIL("No pattern point for polarisation " + std::to_string(polarisation) + ", swath " +
                        std::to_string(swathNumber),
                    STATUS_BAD_PARAMETER);
  std::ifstream in(xca, std::ios::binary);
  if (!in) return AUX_FAIL("File not opened! " + std::string(xca), STATUS_NOT_OPENED);
  unsigned char b[4];
  in.seekg(kXcaPatternOffset + at);
  if (!in.read(reinterpret_cast<char*>(b), 4))
    return AUX_FAIL("File reading failed! " + std::string(xca), STATUS_READ_FAILED);
  *value = ch2float4(b, kMsbFirst);
  return 0;
}

int envi_rgpattern(const char* xca, const char* insPath, const sarpar* par, RangePattern* pattern) {
  std::vector<unsigned char> r;
  if (int st = recordOf(insPath, kInsRecordBytes, r); st != 0) return st;
  if (par->swathNumber < 1 || par->swathNumber > 7)
    return AUX_FAIL("Swath number " + std::to_string(par->swathNumber) + " has no elevation pattern",
                    STATUS_BAD_PARAMETER);
  std::vector<unsigned char> block(kXcaPatternBytes);
  {
    std::ifstream in(xca, std::ios::binary);
    if (!in) return AUX_FAIL("File not opened! " + std::string(xca), STATUS_NOT_OPENED);
    in.seekg(kXcaPatternOffset);
    if (!in.read(reinterpret_cast<char*>(block.data()), kXcaPatternBytes))
      return AUX_FAIL("File reading failed! " + std::string(xca), STATUS_READ_FAILED);
  }
  pattern->firstAngle = ch2float4(r.data() + ins::kPatternAngle + 4 * par->swathNumber, kMsbFirst);
  pattern->step = static_cast<float>(kPatternStepDeg);
  pattern->gain.resize(kPatternPoints);
  const long first = long(par->polarization_type + 4 * par->swathNumber) * kPatternPoints * 4 - 2424;
  for (int p = 0; p < kPatternPoints; ++p) {
    const float db = ch2float4(block.data() + first + 4 * p, kMsbFirst);
    pattern->gain[std::size_t(p)] = static_cast<float>(std::pow(10.0, db / 20.0));
  }
  return 0;
}

int envi_syntchirp(const sarpar* par, std::vector<fcomplex>* chirp) {
  const double fs = par->Sampling_frequency / std::max(1, par->Resampl_fact);
  const double T = par->pulseLength, B = par->chirpBandwidth;
  if (!(fs > 0.0) || !(T > 0.0))
    return AUX_FAIL("Bad sampling frequency or pulse length for the synthetic chirp", STATUS_BAD_PARAMETER);
  const int n = static_cast<int>(T * fs + 0.5);
  const double k = B * consts::kPi / T;
  chirp->assign(std::size_t(std::max(n, 0)), fcomplex{});
  for (int i = 0; i < n; ++i) {
    const double t = (i - (n - 1) * 0.5) / fs;
    const double phase = k * t * t;
    const float re = static_cast<float>(std::cos(phase)), im = static_cast<float>(std::sin(phase));
    (*chirp)[std::size_t(i)] = fcomplex{static_cast<float>(re / n * B), static_cast<float>(im / n * B)};
  }
  return 0;
}

int envi_orbit(const char* orbit, const sarpar* par, AsarOrbit* out) {
  if (!(par->prf > 0.0) || par->lines < 1)
    return AUX_FAIL("No lines or PRF for the orbit of the swath", STATUS_BAD_PARAMETER);
  out->dt = par->lines / par->prf / 3.0;
  out->t0 = par->Azimuth_time_reference - out->dt / 2.0;
  const double centre = par->Azimuth_time_reference + 0.5 * par->lines / par->prf;
  if (int st = interp_orb_l(orbit, centre, 5, out->dt, out->pos, out->vel); st != 0) return AUX_CALLED(st);
  return 0;
}

namespace {
int calibrationTables(const char* insPath, const char* xca, float* fn, float* gn, int polarisation,
                      int swaths) {
  if (polarisation < 0 || polarisation > 1)
    return AUX_FAIL("Calibration tables exist for polarisation 0 and 1 only", STATUS_BAD_PARAMETER);
  std::vector<unsigned char> ri, rx;
  if (int st = recordOf(insPath, kInsRecordBytes, ri); st != 0) return st;
  if (int st = recordOf(xca, kXchRecordBytes, rx); st != 0) return st;
  for (int k = 0; k < 64; ++k) gn[k] = ch2float4(rx.data() + 16 + 256 * polarisation + 4 * k, kMsbFirst);
  for (int s = 0; s < swaths; ++s)
    for (int k = 0; k < 64; ++k)
      fn[64 * s + k] = ch2float4(ri.data() + ins::kCalPulses + 256 * polarisation + 512 * s + 4 * k, kMsbFirst);
  return 0;
}
}  // namespace

int gen_fn_v2(const char* insPath, const char* xca, float* fn, float* gn, int polarisation) {
  return calibrationTables(insPath, xca, fn, gn, polarisation, 7);
}

// WS and GM use the tables of their five sub-swaths, the first five rows of
// the calibration pulse block; they serve the debug dumps only.
int gen_fn(const char* insPath, const char* xca, float* fn, float* gn, int polarisation) {
  return calibrationTables(insPath, xca, fn, gn, polarisation, 5);
}
