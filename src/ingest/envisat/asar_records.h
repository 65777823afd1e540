#pragma once
// Records shared by the ASAR level-0 extraction and its auxiliary readers:
// the per-swath acquisition record, the extraction control record and the
// acquisition modes with the values their packet heads must hold.
#include <string>
#include <vector>

// One record for each swath (IM: one, AP: one per polarisation, WS/GM: five).
struct sarpar {
  double Sampling_frequency = 0.0;  // Hz, from the INS file
  double Carrier_frequency = 0.0;   // Hz, from the INS file
  double prf = 0.0;                 // Sampling_frequency / PRI code
  double nearRangeTime = 0.0;       // s
  double farRangeTime = 0.0;        // s
  double pulseLength = 0.0;         // s, pulse length code / Sampling_frequency
  int chirpBandCode = 0;
  double chirpBandwidth = 0.0;      // Hz, code * 62745.098039215685
  double Azimuth_time_reference = 0.0;  // first echo, seconds since 1985
  double Range_gate_bias = 0.0;     // s, from the INS file
  int SWST_code = 0;                // lowest window start code seen
  int SWST_max_code = 0;            // highest window start code seen
  int Swath_rank = 0;               // PRIs between transmission and echo
  int secondRank = 0;               // the rank-following value of the INS tables
  int Resampl_fact = 1;
  int lines = 0;                    // lines written
  int SWL_code = 0;                 // samples of each echo
  int polarization_type = 0;        // 0 H/H, 1 V/V, 2 H/V, 3 V/H
  int swathNumber = 0;              // IM: digit of the SPH swath name
  int samples = 0;
  int SWL_noise_code = 0;
  int order = 0;                    // place in the burst cycle
  int Number_of_bursts = 0;
  int echoesPerBurst = 0;           // AP: echoes of one polarisation in a burst
  int Noise_packets = 0;
  double meanLatitude = 0.0;        // degrees
  double noisePower = 0.0;
  // Codes that the first pass found most often for this swath.
  int PRI_code = 0;
  int pulseLengthCode = 0;
  int swathCode = 0;
  int firstPacket = 0;
};

enum AsarMode : int { ASAR_IM = 0, ASAR_WS = 1, ASAR_APC = 2, ASAR_APH = 3, ASAR_APV = 4, ASAR_GM = 5 };

struct AsarModeInfo {
  const char* sphName;  // value at SPH offset 20
  int files;            // output rasters
  int modeId;           // mode ID of the packet data field header
  int applicationId;    // application process ID of the packet head
  int firstSwathCode;   // swath code of the first swath
  int swathCount;       // valid codes from firstSwathCode on
};
const AsarModeInfo& asarModeInfo(int mode);
inline bool isApMode(int mode) { return mode >= ASAR_APC && mode <= ASAR_APV; }

// Control record of one extraction.
struct extconf {
  double skip = 0.0;     // percent of the scene skipped at its start
  double extract = 0.0;  // percent kept; 0 or less: the rest
  int packetType = 0;    // 0 echo, 1 calibration, 2 noise
  int mode = -1;
  // For each of the two outputs: window code, missing flag and packet
  // counter of every line written.
  std::vector<int> swst[2], missing[2], sequence[2];
  bool done = false;
  // Lines repaired and the summary of what the walk met.
  int missingLines = 0;
  bool corrupted = false;
  int windowJumps = 0;
};

// Whether the packet-head checks write their reports; off only inside
// re-synchronisation and the backward search of the last packet.
bool asar_reports_on();
void set_asar_reports(bool on);
