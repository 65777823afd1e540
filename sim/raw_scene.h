#pragma once
// The raw-scene simulator: a scene description (text file of sections and
// `key = value` lines), the echoes of point targets from their exact range
// history, distributed clutter and receiver noise, quantisation as the
// sensor does it, the mission's files, and the truth of every target.
#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "base/fcomplex.h"
#include "sim/sim_geometry.h"

// Sections and keys of a text file, in file order; keys may repeat.
struct SimIni {
  struct Entry {
    std::string section, key, value;
  };
  std::vector<Entry> entries;
  // Reads the file; false with a message naming file and line on failure.
  bool load(const std::string& path, std::string& error);
  bool loadText(const std::string& text, std::string& error);
  const std::string* find(const std::string& section, const std::string& key) const;
  double getDouble(const std::string& section, const std::string& key, double fallback) const;
  int getInt(const std::string& section, const std::string& key, int fallback) const;
  std::string getString(const std::string& section, const std::string& key, const std::string& fallback) const;
};

struct SimTarget {
  double latDeg = 0.0, lonDeg = 0.0, height = 0.0, amplitude = 1.0;
};
// A target placed by its raw-scene position: zero-Doppler line (from the
// scene start) and sample of the closest-approach range in the window of
// line 0, at a height.
struct SimPixelTarget {
  double line = 0.0, sample = 0.0, height = 0.0, amplitude = 1.0;
};

// Scene file (sections and keys; every key is optional, defaults are an
// ERS-2 image-mode scene; see tests/sim/data/ers2_small_scene.txt):
//   [Mission] mission (ERS1|ERS2), carrier_ghz, sampling_rate_mhz, prf_hz,
//             pulse_length_us, chirp_coefficient, antenna_length_m,
//             look_side (right|left)
//   [Orbit]   semi_major_axis_m, eccentricity, inclination_deg,
//             node_longitude_deg (Earth-fixed, at the epoch), arg_perigee_deg,
//             mean_anomaly_deg, epoch ("DD-MMM-YYYY HH:MM:SS.mmm", default the start)
//   [Scene]   start_time, lines, samples, near_range_time_s,
//             doppler_centroid_hz or yaw_deg/pitch_deg, pattern_extent,
//             swst_change_line, swst_change_codes,
//             orbit_number, frame, arc_number, facility, scene_dir,
//             file_names (upper|lower), odr_form (xODR|@ODR), odr_records,
//             bias_i, bias_q
//   [Targets] target* = lat lon height [amplitude];
//             pixel_target* = line sample height [amplitude]
//   [Clutter] clutter_sigma, noise_sigma, seed
//   [Damage]  drop_lines (e.g. "100 200-205"), corrupt_swst_lines,
//             corrupt_swst_delta, truncate_image_bytes,
//             leader_patch = <file offset> <text> (repeatable)
struct SceneDescription {
  std::string mission = "ERS2";   // "ERS1" or "ERS2"
  // Radar; each value is kept at the precision the leader records it with.
  double carrierHz = 5.3e9;
  double samplingRateHz = 18.962468e6;
  double prfHz = 1679.902;
  double pulseLength = 37.12e-6;
  double chirpCoefficient = 2.08894e11;  // chirp rate = 2 x coefficient
  double antennaLength = 10.0;
  int lookSign = 1;                      // +1 right, -1 left
  double dopplerCentroidHz = 0.0;
  // Attitude instead of an explicit centroid: the beam of the zero-Doppler
  // look to the scene centre turned by the yaw (about the local vertical)
  // and the pitch (about the cross-track axis); positive turns it forward.
  bool attitudeGiven = false;
  double yawDeg = 0.0, pitchDeg = 0.0;
  double patternExtent = 1.0;            // azimuth pattern kept to this many first nulls
  KeplerElements orbit;
  // Acquisition.
  double startTime = 0.0;                // seconds since 1985, whole milliseconds
  int lines = 2048;
  int samples = 1024;
  double nearRangeTime = 0.00555;        // wanted window start, two-way seconds
  // A sampling-window change: from this line on (if >= 0) the window code
  // moves by swstChangeCodes (4 / fs each).
  int swstChangeLine = -1;
  int swstChangeCodes = 0;
  // Window start of a code for sensors other than ERS: code x swstStep +
  // swstOffset seconds (used when swstStep > 0; ENVISAT: 1 / fs and
  // rank / PRF - range gate bias).
  double swstStep = 0.0, swstOffset = 0.0;
  std::vector<SimTarget> targets;
  std::vector<SimPixelTarget> pixelTargets;
  double clutterSigma = 0.0;             // counts per I/Q component, before quantisation
  double noiseSigma = 0.0;
  std::uint64_t seed = 1;
  double biasI = -9999999.9999999, biasQ = -9999999.9999999;  // absent unless set
  // Product identification.
  int orbitNumber = 12345, frame = 2925, arcNumber = 123;
  std::string facility = "SIM-PAF";
  std::string sceneDir = "scene";
  bool upperCaseNames = true;
  bool xodr = true;
  int odrRecords = 7921;
  // Damage.
  std::vector<int> dropLines;            // raw lines not written to the image file
  std::vector<int> corruptSwstLines;     // lines whose window code is recorded wrong
  int corruptSwstDelta = 1000;
  long long truncateImageBytes = 0;      // > 0: image file cut to this size
  std::vector<std::pair<int, std::string>> leaderPatches;  // file offset, text written over the leader
  // Window start of every line, two-way seconds, for a mission whose writer
  // codes the window by its own rule ("RSAT1"); empty: the ERS code rule.
  std::vector<double> lineWindowStarts;

  // Reads a scene file; false with a message on a bad or missing value.
  static bool load(const std::string& path, SceneDescription& out, std::string& error);
  static bool fromIni(const SimIni& ini, SceneDescription& out, std::string& error);
};

struct TargetTruth {
  double latDeg = 0.0, lonDeg = 0.0, height = 0.0, amplitude = 0.0;
  Vec3 position{};
  double azimuthTime = 0.0;      // zero-Doppler time, seconds since 1985
  double slantRange = 0.0;       // at closest approach, m
  double rangeTime = 0.0;        // two-way, s
  double expectedPhase = 0.0;    // -4 pi R0 / lambda wrapped to (-pi, pi]
  double line = 0.0;             // (azimuthTime - first line time) x PRF
  double sample = 0.0;           // (rangeTime - window start of line 0) x fs + range peak offset
  double beamCentreTime = 0.0;   // Doppler equal to the centroid
  int firstLine = 0, lastLine = -1;  // raw lines the echo covers (may lie outside the scene)
};

class RawSceneSimulator {
 public:
  // Throws std::runtime_error for a description it cannot simulate.
  explicit RawSceneSimulator(SceneDescription scene);

  const SceneDescription& scene() const { return scene_; }
  const SimOrbit& orbit() const { return orbit_; }
  const std::vector<TargetTruth>& truth() const { return truth_; }
  double wavelength() const;
  double chirpRate() const { return 2.0 * scene_.chirpCoefficient; }
  double lineTime(int line) const { return scene_.startTime + line / scene_.prfHz; }
  int swstCode() const { return swstCode_; }
  // Window start of line 0, two-way seconds (the extractor's code formula).
  double swst() const { return swst_; }
  // Window code of a line (with the scene's window change, if any).
  int swstCodeOf(int line) const;
  // Window start of a code, two-way seconds.
  double swstSeconds(int code) const;
  int replicaLength() const;
  // Where the range-compressed peak lies after the two-way delay, samples.
  double rangePeakOffset() const;
  int priCode() const;
  // Doppler centroid at the scene centre of a yaw and pitch, Hz.
  double attitudeDoppler(double yawDeg, double pitchDeg) const;

  // Complex echoes of lines [first, first + count) before quantisation,
  // row-major count x samples. Deterministic and independent of the
  // block partition and of the number of threads.
  void renderLines(int first, int count, std::vector<fcomplex>& out) const;
  // 5-bit offset I/Q bytes of one line, with the leader's biases.
  void quantiseLine(const fcomplex* in, unsigned char* iq) const;

  // Writes <outDir>/<sceneDir>/{LEA_01.001, DAT_01.001, VDF_DAT.001,
  // NUL_DAT.001}, <outDir>/orbits/ERS1/PRECISE/arclist, the ODR arc and
  // <outDir>/truth.txt. Returns 0, or 5 with a message on a write failure.
  int writeErsScene(const std::string& outDir, std::string& error) const;
  std::string leaderPath(const std::string& outDir) const;
  std::string imagePath(const std::string& outDir) const;
  std::string odrPath(const std::string& outDir) const;
  int writeTruth(const std::string& path, std::string& error) const;

 private:
  void computeTruth();
  void addTargets(int line, fcomplex* row) const;

  SceneDescription scene_;
  SimOrbit orbit_;
  int swstCode_ = 0;
  double swst_ = 0.0;
  std::vector<TargetTruth> truth_;
  std::vector<float> rangeTaps_;
  std::vector<fcomplex> azimuthTaps_;
};

// The extractor's conversion of a window code to seconds.
double ersSwstSeconds(int code);
