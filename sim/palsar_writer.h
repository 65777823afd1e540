#pragma once
// ALOS PALSAR level-1.0 products of the simulator: the CEOS leader (file
// descriptor, data set summary, platform position record, facility filler)
// and one image file per polarisation, in the JAXA layout (records from 720,
// 412-byte line prefix) or the ERSDAC layout (records from 16252, 292-byte
// line prefix). The echoes come from RawSceneSimulator, one simulation per
// polarisation with its own scattering; the first polarisation's truth is the
// truth of the scene. Polarimetric products carry twice the PRF of a
// channel in the leader and alternate H and V transmissions: the V-transmit
// echoes are received half a channel PRI after the H-transmit ones, and
// every record carries the time of its pair's H transmission.
#include <string>
#include <utility>
#include <vector>

#include "sim/raw_scene.h"

struct PalsarSimConfig {
  std::string layout = "JAXA";  // JAXA or ERSDAC
  std::string mode = "FBS";     // FBS (HH), FBD (HH, HV) or PLR (HH, HV, VH, VV)
  int maxMissingLines = 100;    // leader field
  int beam = 7;
  double offNadirDeg = 34.3;
  // Amplitude of the targets and clutter of each polarisation, relative to HH.
  std::vector<double> channelScale = {1.0, 0.45, 0.45, 0.8};

  // Radio interference added to every polarisation before quantisation:
  // persistent tones (frequency from the band centre in Hz, power in dB
  // over the clutter in the tone's bin of a 256-bin range spectrum) across
  // the whole scene, and bursts (raw line, dB over the clutter in the
  // burst's bin of that spectrum) of one line each.
  std::vector<std::pair<double, double>> tones;
  std::vector<std::pair<int, double>> bursts;

  // [PALSAR] layout, mode, max_missing_lines, beam, off_nadir_deg,
  // tones ("freq_hz:db ..."), bursts ("line:db ...").
  static bool fromIni(const SimIni& ini, PalsarSimConfig& out, std::string& error);
  int channels() const { return mode == "PLR" ? 4 : mode == "FBD" ? 2 : 1; }
  bool ersdac() const { return layout == "ERSDAC"; }
};

// PALSAR constants in a scene: wavelength 0.2361 m, chirp of 28 MHz (FBS,
// PLR) or 14 MHz (FBD) over 27 us with the down-chirp sign, sampling 32 or
// 16 MHz, antenna 8.9 m, orbit at 692 km, window start in whole metres of
// slant range.
void applyPalsarInstrument(const PalsarSimConfig& cfg, SceneDescription& scene);

struct PalsarSceneFiles {
  std::string leader;
  std::vector<std::string> images;  // one per polarisation, HH first
  std::vector<std::string> labels;  // "HH", "HV", ...
};
// Writes <outDir>/<leader>, the image files and <outDir>/truth.txt. 0, or 5
// with a message.
int writePalsarScene(const SceneDescription& scene, const PalsarSimConfig& cfg, const std::string& outDir,
                     PalsarSceneFiles* files, std::string& error);

inline constexpr int kPalsarJaxaImageStart = 720;
inline constexpr int kPalsarErsdacImageStart = 16252;
inline constexpr int kPalsarJaxaPrefix = 412;
inline constexpr int kPalsarErsdacPrefix = 292;
