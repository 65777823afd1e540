#pragma once
// ASAR level-0 products of the simulator: the main and specific headers,
// and one instrument source packet for each line of a simulated scene
// (68-byte head, FBAQ-encoded echo) on the instrument's timeline: image mode
// with a periodic calibration packet after every 1023 echoes, alternating
// polarisation with bursts of echoes of one polarisation, then the other.
// The echoes come from RawSceneSimulator; damage can be injected.
#include <string>
#include <utility>
#include <vector>

#include "sim/raw_scene.h"

struct AsarSimConfig {
  std::string mode = "IM";           // IM, APC, APH or APV
  int swath = 2;                     // IS1..IS7
  std::string polarisation = "V/V";  // IM only
  int firstCounter = -1;             // mode packet counter of line 0; -1: inside the third cycle
  int apBurst = 0;                   // echoes of one polarisation in a burst; 0: the swath's INS value
  int priCode = 11641;               // PRF = fs / PRI code
  int pulseCode = 519;               // pulse length = code / fs
  int chirpCode = 255;               // bandwidth = code x 62745.098 Hz
  int absoluteOrbit = 30000;
  // Damage besides the scene's dropped lines, window corruption and truncation:
  std::vector<std::pair<int, int>> garbage;  // (line, bytes) written after that line's packet
  std::vector<int> counterJumpLines;         // packets whose counters jump far ahead

  // [ASAR] mode, swath, polarisation, first_counter, ap_burst_echoes, pri_code,
  // pulse_code, chirp_code, absolute_orbit, garbage ("line:bytes ..."),
  // counter_jump_lines ("line ...").
  static bool fromIni(const SimIni& ini, AsarSimConfig& out, std::string& error);
  bool imageMode() const { return mode == "IM"; }
  int firstLineCounter() const;
  int burstEchoes() const;
};

// Sets the instrument constants of ASAR in a scene: carrier, sampling rate,
// PRF, pulse and chirp from the codes, and the window start of a code
// (code / fs + rank / PRF - range gate bias).
void applyAsarInstrument(const AsarSimConfig& cfg, SceneDescription& scene);

// Whether a line of the scene carries an echo (IM: not a calibration slot),
// and the polarisation index (0 or 1) of an AP echo.
bool asarLineIsEcho(const AsarSimConfig& cfg, int line);
int asarLinePolarisation(const AsarSimConfig& cfg, int line);

struct AsarSceneFiles {
  std::string level0, ins, xca, xch, orbit, auxDir, orbitDir;
};
// Writes <outDir>/<level-0 product>, <outDir>/aux/{ASA_INS, ASA_XCA,
// ASA_XCH}, <outDir>/orbits/DOR_VOR and <outDir>/truth.txt. 0, or 5 with a
// message.
int writeEnvisatScene(const RawSceneSimulator& sim, const AsarSimConfig& cfg, const std::string& outDir,
                      AsarSceneFiles* files, std::string& error);
