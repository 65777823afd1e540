#pragma once
// Writers of the ENVISAT auxiliary products a simulated ASAR scene needs:
// the instrument characterisation (ASA_INS) with the FBAQ reconstruction
// tables, ranks, range gate bias, droop model and calibration pulses; the
// external calibration (ASA_XCA) with elevation patterns; the external
// characterisation (ASA_XCH); and the DORIS precise orbit (DOR_VOR). All
// numbers are big-endian; the headers follow the main and specific product
// header layout of the archive products.
#include <cstdint>
#include <string>
#include <vector>

#include "base/fcomplex.h"
#include "sim/sim_geometry.h"

// ASAR instrument constants as the simulated INS file holds them (32-bit
// floats of the record).
namespace asar_sim {
inline constexpr float kCarrierHz = 5331004416.0f;
inline constexpr float kSamplingHz = 19207680.0f;
inline constexpr float kRangeGateBias = 5.0995e-07f;
// Ranks of the swaths IS1..IS7 (IM and AP). The value that follows each
// rank table counts echoes: 1023 echoes of an IM cycle before its
// calibration packet, and in AP the echoes of one polarisation's burst
// before the instrument switches to the other (a cycle of two bursts). The
// AP values grow with the swath so that a burst spans about the same
// Doppler band, |Doppler rate| x echoes / PRF (some 250 Hz in IS2), at
// every incidence; four such bands are about the antenna's Doppler band.
inline constexpr int kRanks[7] = {9, 9, 12, 10, 13, 11, 14};
inline constexpr int kApBurstEchoes[7] = {194, 196, 257, 218, 277, 238, 297};
// Boresight-related first elevation angle of each swath's pattern, degrees.
inline constexpr float kFirstAngles[7] = {16.628f, 20.138f, 25.243f, 29.533f, 32.818f, 35.633f, 38.058f};
// Droop model: temperature and a1 b1 tau1 a2 b2 tau2 a3 b3.
inline constexpr float kDroopTemperature = 5.0f;
inline constexpr double kDroopModel[8] = {-0.004739, 0.403, 25.0, -0.004232, 0.4697, 175.0, 0.0006683, -0.06206};
inline constexpr int kInsRecordBytes = 171648;
inline constexpr int kXcaRecordBytes = 26552;
inline constexpr int kXchRecordBytes = 596;
}  // namespace asar_sim

// 8-to-4 FBAQ of the simulator: block code b scales a 4-bit Gaussian
// quantiser to the standard deviation sigma(b) = 0.01 x 1.05^b; level index
// 0 is the most negative value, 15 the most positive.
class FbaqCodec {
 public:
  static double sigma(int code);
  static float level(int levelIndex, int code);
  // Block code for a block whose I and Q have the standard deviation s.
  static int codeFor(double s);
  // 4-bit sign and magnitude code of the level nearest to v.
  static int nibbleFor(float v, int code);
  // Bytes of one line of `samples` samples: 64-byte blocks (code byte and
  // 63 samples), the last block shorter and padded to an even length.
  static int lineBytes(int samples);
  // Encodes one line into lineBytes(samples) bytes.
  static void encodeLine(const fcomplex* in, int samples, unsigned char* out);
};

// Big-endian stores of the ENVISAT formats.
void asarPutBE32(unsigned char* p, std::uint32_t v);
void asarPutBE16(unsigned char* p, unsigned v);

// Amplitude gain of the receiver droop at range sample k (the INS model).
double asarSimDroopGain(int k);

// Main product header of 1247 bytes with PRODUCT, the processing time and
// the sensing start and stop at the places readers look for them.
std::string envisatMph(const std::string& productName, double procTime, double sensingStart, double sensingStop);
// "DD-MMM-YYYY HH:MM:SS.uuuuuu" of a time since 1985.
std::string envisatDate(double sec85);
// "YYYYMMDD_HHMMSS" of a time since 1985.
std::string envisatCompact(double sec85);

// Auxiliary file name "<prefix>YYYYMMDD_HHMMSS_<start>_<stop>" as the archive writes it.
std::string envisatAuxName(const std::string& prefix, double generation, double validStart, double validStop);

// The complete products; 0, or 5 with a message.
int writeAsarIns(const std::string& path, double generation, double validStart, double validStop, std::string& error);
int writeAsarXca(const std::string& path, double generation, double validStart, double validStop, std::string& error);
int writeAsarXch(const std::string& path, double generation, double validStart, double validStop, std::string& error);
// DOR_VOR of 60-second records from start to stop of the orbit.
int writeDorVor(const std::string& path, const SimOrbit& orbit, double generation, double start, double stop,
                int absoluteOrbit, std::string& error);
