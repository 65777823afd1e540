#pragma once
// RADARSAT-1 CEOS raw products for the simulator: the leader (file
// descriptor, data set summary, platform position record with the state
// vectors) and the signal data file (16,252-byte descriptor, then per line
// the 192-byte CEOS head, the 50-byte auxiliary head with its sync marker
// and bit-packed fields, and the samples: one byte per I and per Q holding a
// 4-bit two's complement value v that stands for v + 0.5). The echoes come
// from RawSceneSimulator.
#include <string>
#include <vector>

#include "sim/raw_scene.h"

struct RadarsatOptions {
  std::string beam = "S1";   // S1..S7, F1..F5
  int waveform = 0;          // chirp bandwidth selector: 0 30 MHz, 1 17.28 MHz, 2 11.58 MHz
  int rateCode = 1;          // ADC rate: 0 32.3 MHz, 1 18.5 MHz, 2 12.9 MHz
  int priCode = 0;           // 0: chosen from the scene's PRF
  int windowCode = -1;       // -1: chosen from the scene's near range time
  int gainCode = 10;         // receiver attenuation, dB
  int replicaEvery = 0;      // a replica on line 0 and every so many lines (0: line 0 only)
  int windowChangeLine = -1, windowChangeCodes = 0;
  int gainChangeLine = -1, gainChangeDb = 0;
  double scale = 1.0;        // echo counts per unit of the scene's amplitude
  // "public": sync marker and the fields where archive products hold them;
  // "table": the head without the 12 bytes of marker and identifier, and
  // samples as offset bytes with the zero level 15.5.
  std::string layout = "public";
  // Damage.
  int badBeamCode = 0;           // > 0: this beam code on every line
  int damagedHeadLine = -1;      // this line's CEOS record type is broken
  std::vector<int> dropLines;    // lines left out of the file
  long long truncateBytes = 0;   // > 0: data file cut to this size

  // [Radarsat] section of a scene file; false with a message on a bad value.
  static bool fromIni(const SimIni& ini, RadarsatOptions& out, std::string& error);
};

// A RADARSAT scene: the scene description adjusted to the beam, rates and
// codes (sampling rate, PRF, pulse, window start per line), and its writer.
class RadarsatSceneWriter {
 public:
  // Throws std::runtime_error for options it cannot simulate.
  RadarsatSceneWriter(SceneDescription scene, RadarsatOptions options);
  const RawSceneSimulator& simulator() const { return sim_; }
  const RadarsatOptions& options() const { return opt_; }
  int pulsesInFlight() const { return pulses_; }
  int beamCode() const { return beamCode_; }
  double firstUnit() const { return unit_; }
  int windowCodeOf(int line) const;
  int gainCodeOf(int line) const;
  // Replica window and the chirp centred in it, complex samples.
  int replicaSamples() const { return replicaSamples_; }
  int pulseSamples() const { return static_cast<int>(42.0e-6 * sim_.scene().samplingRateHz + 0.5); }
  int recordSlots() const { return replicaSamples_ + sim_.scene().samples; }

  // Writes <outDir>/<sceneDir>/{LEA_01.001, DAT_01.001} and <outDir>/truth.txt.
  // 0, or 5 with a message on a write failure.
  int write(const std::string& outDir, std::string& error) const;
  std::string leaderPath(const std::string& outDir) const;
  std::string dataPath(const std::string& outDir) const;
  // The leader alone (vectors every 8 s over the scene and 30 s around it);
  // an SLC product's leader names its level and gives the sampling rate, the
  // PRF and the direction of the line time in the data set summary.
  std::vector<char> buildLeader(bool slc = false, bool timeDecreasing = false) const;
  // An SLC product of the scene's size in place of the raw one: the image
  // file holds per line the 192-byte head (line time, slant range of the
  // first pixel) and big-endian 16-bit I and Q of slcPixel(); with
  // timeDecreasing the last line comes first.
  int writeSlc(const std::string& outDir, bool timeDecreasing, std::string& error) const;
  // A RADARSAT text orbit file of the scene's orbit: the named blocks, then
  // one "STATE VECTOR:" line per minute over 10 minutes either side of the
  // scene, inertial (true of date) through the Greenwich angle the file
  // gives at midnight of the scene's day.
  int writeTextOrbit(const std::string& path, std::string& error) const;
  static void slcPixel(int line, int sample, int& i, int& q) {
    i = (line * 31 + sample * 7) % 4001 - 2000;
    q = 1000 - (line * 13 + sample * 11) % 3001;
  }
  // The 50-byte auxiliary head of a line in the public layout.
  void packAux(int line, bool replica, unsigned char* aux) const;

 private:
  static SceneDescription adjusted(SceneDescription scene, RadarsatOptions& opt, int& beamCode, int& pulses,
                                   double& unit, int& replicaSamples);
  RadarsatOptions opt_;
  int beamCode_ = 0, pulses_ = 0, replicaSamples_ = 0;
  double unit_ = 0.0;
  RawSceneSimulator sim_;
};
