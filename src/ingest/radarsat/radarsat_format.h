#pragma once
// RADARSAT-1 CEOS raw signal data: the 50-byte auxiliary head of each line,
// the beam and rate tables, and the 4-bit samples.
//
// Genuine archive products (RSI/CDPF CEOS signal data and the readers that
// process them) carry a four-byte sync marker 0x352EF853 and an image
// reference identifier in front of the payload words, so every field sits 12
// bytes further on than in a head without them. Only that layout is
// accepted: a head without the marker is refused with a message naming the
// file and the line.
#include <array>
#include <cstdint>
#include <string>

namespace radarsat {

inline constexpr int kDescriptorBytes = 16252;  // signal data file descriptor
inline constexpr int kLineHeadBytes = 192;      // CEOS prefix of a signal data record
inline constexpr int kAuxBytes = 50;            // auxiliary head behind it
inline constexpr std::array<unsigned char, 4> kAuxSync = {0x35, 0x2E, 0xF8, 0x53};
// Record type bytes 5 to 8 of a signal data record.
inline constexpr std::array<unsigned char, 4> kSignalRecordType = {0x32, 0x0B, 0x12, 0x14};

inline constexpr double kCarrierHz = 5300432425.742575;
inline constexpr double kWavelength = 0.05656;
inline constexpr double kPulseLength = 4.2e-05;
inline constexpr double kWindowOffset = 4.2e-06;
// A line that carries the chirp replica starts with a replica window of
// 44.559 us: longer than the 42 us pulse, so the loop-back catches the whole
// chirp. Reading only 42 us of it would leave the last 83 replica samples
// (at 32.3 MHz) in front of the echo and shift every such line in range.
inline constexpr double kReplicaWindow = 44.559e-06;

// Decoded auxiliary head (offsets of the public layout, from the sync marker).
struct AuxHead {
  bool syncOk = false;
  int waveform = 0;     // byte 12, high nibble: chirp bandwidth selector
  int beamCode = 0;     // bytes 18-19, big-endian
  int rateCode = 0;     // byte 22, bits 5 and 4: ADC rate
  int priCode = 0;      // (byte 25 << 5) + (byte 26 >> 3)
  int windowCode = 0;   // (byte 27 << 4) + (byte 28 >> 4)
  int rxCode = 0;       // (byte 29 << 4) + (byte 30 >> 4)
  int day = 0;          // (byte 43 << 3) + (byte 44 >> 5), day of the year
  int seconds = 0;      // ((byte 44 & 31) << 12) + (byte 45 << 4) + (byte 46 >> 4)
  int milliseconds = 0; // ((byte 46 & 15) << 6) + (byte 47 >> 2)
  int fraction = 0;     // ((byte 47 & 3) << 8) + byte 48, in 1/1024 ms: the field
                        // refines the milliseconds, so its unit is a millisecond's
  bool replica = false; // byte 49, bit 6
  int gainCode = 0;     // byte 49, low 6 bits: receiver attenuation, dB
};
AuxHead decodeAux(const unsigned char* aux);

struct RateEntry {
  // Bytes of the replica window, I and Q: 44.559 us at the ADC clock of the
  // sampling master oscillator (129.2683 MHz divided by 4, 7 or 10),
  // truncated, twice: 1440, 822 and 576 complex samples. (The rounded second
  // unit would give 575 at the lowest rate, one short of what was recorded.)
  int referenceSamples;
  double firstUnit;   // PRI, window start and duration step, s (6 ADC periods)
  double secondUnit;  // ADC sampling period, s
  int replicaWindowSamples() const { return referenceSamples / 2; }
};
// Rate codes 0..2; nullptr for any other.
const RateEntry* rateEntry(int code);

struct BeamEntry {
  const char* name;
  int pulsesInFlight;
};
// Beam codes 1..20; nullptr outside.
const BeamEntry* beamEntry(int code);

// Chirp bandwidth of a waveform selector (30, 17.28, 11.58 MHz); 0 if unknown.
// These are the bandwidths of the transmitted pulse; the sampling rate of a
// line is the ADC rate of its rate code (one second unit per sample).
double waveformBandwidth(int code);

// Seconds of the day of a head: seconds + (milliseconds + fraction / 1024) / 1000.
double auxSecondsOfDay(const AuxHead& h);
// Sampling window start of a line, two-way seconds.
double windowStart(int windowCode, int priCode, const RateEntry& rate, int pulsesInFlight);
// Where the 42 us chirp sits in a replica window of W samples: centred, its
// first sample at (W - P) / 2 for P = round(42 us * fs) pulse samples.
inline int replicaPulseSamples(double fs) { return static_cast<int>(kPulseLength * fs + 0.5); }
inline int replicaPulseOffset(int windowSamples, int pulseSamples) { return (windowSamples - pulseSamples) / 2; }
// Samples of a line of reception-duration code c: 6 (c + 1).
inline int rxSamples(int rxCode) { return 6 * (rxCode + 1); }

// A sample byte holds a 4-bit two's complement value v in its low nibble,
// standing for v + 0.5: the converter's levels are symmetric about zero.
// Archive products store the signed nibble, not an offset byte with a zero
// level of 15.5 as the 5-bit ERS converter does.
inline float sampleValue(unsigned char byte) {
  const int v = (byte & 0x0F) >= 8 ? int(byte & 0x0F) - 16 : int(byte & 0x0F);
  return static_cast<float>(v) + 0.5f;
}

}  // namespace radarsat
