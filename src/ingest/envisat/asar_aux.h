#pragma once
// ASAR auxiliary data and FBAQ decoding: the reconstruction tables and the
// droop gain of the instrument characterisation file (ASA_INS), its other
// constants, the elevation patterns of the external calibration file
// (ASA_XCA), the calibration pulse tables, the synthetic chirp and the
// orbit of a swath. Every number of these products is big-endian.
#include <array>
#include <string>
#include <vector>

#include "base/fcomplex.h"
#include "ingest/envisat/asar_records.h"

inline constexpr long kAsarMphBytes = 1247;
inline constexpr long kAuxSphBytes = 378;
inline constexpr long kInsRecordBytes = 171648;
inline constexpr long kXchRecordBytes = 596;
inline constexpr long kXcaPatternOffset = 1625;
inline constexpr long kXcaPatternBytes = 26552;
inline constexpr int kFbaqLevels = 16;
inline constexpr int kFbaqCodes = 256;
inline constexpr int kDroopSamples = 8192;
inline constexpr int kPatternPoints = 201;
inline constexpr double kPatternStepDeg = 0.05;

// Offsets in the INS data record.
namespace ins {
inline constexpr long kCarrier = 16, kSampling = 20, kRangeGateBias = 69912;
inline constexpr long kTableI = 74656, kTableQ = 103328;
inline constexpr long kImSecondRank = 161606, kImRank = 161620;
inline constexpr long kApSecondRank = 161662, kApRank = 161676;
inline constexpr long kWsSecondRank = 161690, kWsRank = 161704;
inline constexpr long kPatternAngle = 161916, kCalPulses = 162016;
inline constexpr long kDroopTemperature = 171368, kDroopModel = 171372;
}  // namespace ins

// Reconstruction tables of the 8-to-4 FBAQ, [level][block code].
struct FbaqTables {
  std::array<float, kFbaqLevels * kFbaqCodes> I{}, Q{};
};
// Fills both tables from the INS file and keeps them as the tables of the
// decoder. tableQ and tableI may be null.
int LUTfbaq_f(const char* ins, float* tableQ, float* tableI);
// The tables the decoder uses (process-wide, one thread).
FbaqTables& fbaq_tables();

// Echo decoder: blocks of a code byte and 63 data bytes, a shorter last
// block; `lines` lines of samples (samples / factor) complex values into out.
// 1 when bytes is not a whole number of lines.
int fbaq_decode84_f(const unsigned char* data, float* out, int bytes, int samples, int factor,
                    int* floats, int* lines);
// Noise decoder: one byte a sample through the fixed noise levels.
int fbaq_decode84fe(const unsigned char* data, float* out, int bytes, int samples, int factor,
                    int* floats, int* lines);
// Bytes of one echo line of `samples` samples.
int fbaq_line_bytes(int samples);

// Amplitude correction of the receiver droop for `count` range samples.
int getDROOPgain(const char* ins, float* gain, int count);

// Sampling and carrier frequency, range gate bias and ranks of the swaths
// in use (`swathCodes[i]` is the packet swath code of par[i]).
int asainspar(const char* ins, sarpar* par, int mode, const int* swathCodes, int swaths);

// Elevation pattern of a swath: 201 linear amplitudes from firstAngle on.
struct RangePattern {
  float firstAngle = 0.0f;  // degrees
  float step = static_cast<float>(kPatternStepDeg);
  std::vector<float> gain;
};
int envi_rgpattern(const char* xca, const char* ins, const sarpar* par, RangePattern* pattern);
// dB value of one pattern point of the XCA file, for tests and reports.
int xca_pattern_db(const char* xca, int polarisation, int swathNumber, int point, float* value);

// Reference chirp of the range focuser, synthesised from the pulse constants.
int envi_syntchirp(const sarpar* par, std::vector<fcomplex>* chirp);

// Five state vectors around the centre of the swath, lines / PRF / 3 apart.
struct AsarOrbit {
  double t0 = 0.0, dt = 0.0;
  double pos[15] = {}, vel[15] = {};
};
int envi_orbit(const char* orbit, const sarpar* par, AsarOrbit* out);

// Calibration pulse tables: gn 64 floats of the XCA/XCH record for the
// polarisation, fn 64 floats for each of the 7 (IM, AP) or 5 (WS, GM) swaths.
int gen_fn_v2(const char* ins, const char* xca, float* fn, float* gn, int polarisation);
int gen_fn(const char* ins, const char* xca, float* fn, float* gn, int polarisation);
