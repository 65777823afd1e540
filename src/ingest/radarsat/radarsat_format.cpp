// Tables and field decoding of the RADARSAT-1 auxiliary head.
#include "ingest/radarsat/radarsat_format.h"

#include <algorithm>

namespace radarsat {

AuxHead decodeAux(const unsigned char* a) {
  AuxHead h;
  h.syncOk = std::equal(kAuxSync.begin(), kAuxSync.end(), a);
  h.waveform = a[12] >> 4;
  h.beamCode = (int(a[18]) << 8) | int(a[19]);
  h.rateCode = (a[22] >> 4) & 3;
  h.priCode = (int(a[25]) << 5) + (a[26] >> 3);
  h.windowCode = (int(a[27]) << 4) + (a[28] >> 4);
  h.rxCode = (int(a[29]) << 4) + (a[30] >> 4);
  h.day = (int(a[43]) << 3) + (a[44] >> 5);
  h.seconds = ((int(a[44]) & 31) << 12) + (int(a[45]) << 4) + (a[46] >> 4);
  h.milliseconds = ((int(a[46]) & 15) << 6) + (a[47] >> 2);
  h.fraction = ((int(a[47]) & 3) << 8) + a[48];
  h.replica = (a[49] & 0x40) != 0;
  h.gainCode = a[49] & 0x3F;
  return h;
}

const RateEntry* rateEntry(int code) {
  // The first unit is six ADC periods: the ADC runs at 32.317, 18.467 and
  // 12.927 MHz.
  static constexpr RateEntry kRates[3] = {
      {2880, 1.8566e-07, 3.094e-08}, {1644, 3.2491e-07, 5.415e-08}, {1152, 4.6415e-07, 7.736e-08}};
  return code >= 0 && code < 3 ? &kRates[code] : nullptr;
}

const BeamEntry* beamEntry(int code) {
  static constexpr BeamEntry kBeams[20] = {
      {"S1", 7}, {"S2", 7}, {"S3", 8}, {"S4", 8},  {"S5", 8},  {"S6", 9}, {"S7", 9},
      {"W1", 7}, {"W2", 8}, {"W3", 8}, {"W4", 8},  {"E1", 7},  {"E2", 10}, {"E3", 11},
      {"E4", 11}, {"F1", 8}, {"F2", 8}, {"F3", 9}, {"F4", 9}, {"F5", 9}};
  return code >= 1 && code <= 20 ? &kBeams[code - 1] : nullptr;
}

double waveformBandwidth(int code) {
  switch (code) {
    case 0: return 30000000.0;
    case 1: return 17280000.0;
    case 2: return 11580000.0;
    default: return 0.0;
  }
}

double auxSecondsOfDay(const AuxHead& h) {
  return h.seconds + (h.milliseconds + h.fraction / 1024.0) / 1000.0;
}

double windowStart(int windowCode, int priCode, const RateEntry& rate, int pulsesInFlight) {
  const double pri = (priCode + 2.0) * rate.firstUnit;
  return (windowCode + 5) * rate.firstUnit - kWindowOffset + pulsesInFlight * pri;
}

}  // namespace radarsat
