#pragma once
// Simulated inputs of the tests, from single range lines to sensor scenes:
//  - support::raw: echoes of point targets in raw range lines (ERS-like
//    chirp), with sampling-window changes, for range focusing;
//  - support::compressed: range-compressed point-target echoes of an
//    ERS-like straight-line geometry, for azimuth focusing;
//  - support::clutter: range-compressed clutter with a chosen Doppler
//    centroid, for the centroid estimators;
//  - support: whole sensor scenes written to disk by the simulator (sim/)
//    with their truth file, for the executable.
#include <cmath>
#include <complex>
#include <fstream>
#include <map>
#include <numbers>
#include <string>
#include <vector>

#include "base/fcomplex.h"
#include "core/azimuth_focus.h"
#include "core/fft.h"
#include "core/range_focus.h"
#include "doppler/dc_state.h"
#include "sim/envisat_level0_writer.h"
#include "sim/palsar_writer.h"
#include "sim/raw_scene.h"

namespace support {

// ---- whole sensor scenes ----------------------------------------------

// A simulated scene on disk: the sensor's input files by role, and the truth
// file of the simulator (targets, sampling, windows) that sarpta reads.
struct SensorScene {
  std::string root;   // folder of the simulation
  std::string truth;  // truth file
  std::map<std::string, std::string> files;
  const std::string& operator[](const std::string& role) const { return files.at(role); }
};

// The orbit and radar of the example ERS-2 scene (a descending pass).
SceneDescription ersScene(int lines, int samples, double dopplerHz);

// The files of an ERS scene simulated under folder/sim, by role: "image",
// "leader", "orbit", "orbit_archive".
SensorScene ersSceneFiles(const RawSceneSimulator& sim, const std::string& folder);
// Writes an ERS scene (CEOS image and leader, DEOS orbit arc and its archive
// folder) under folder/sim. false with the message on failure.
bool simulateErs(const SceneDescription& scene, const std::string& folder, SensorScene& out,
                 std::string& error);

// The example orbit with the ASAR instrument of `cfg` (mode, swath, codes,
// absolute orbit).
SceneDescription envisatScene(const AsarSimConfig& cfg, int lines, int samples, double dopplerHz);
// Writes an ENVISAT scene under folder/sim: the level-0 product, the
// instrument and calibration files in one folder, the DORIS orbit in
// another. Roles: "image", "ins", "xca", "xch", "orbit", "aux_dir",
// "orbit_dir". false with the message on failure.
bool simulateEnvisat(const SceneDescription& scene, const AsarSimConfig& cfg, const std::string& folder,
                     SensorScene& out, std::string& error);

// The example orbit with the PALSAR instrument of `cfg` (L band, mode,
// layout), clutter and noise, no targets.
SceneDescription palsarScene(const PalsarSimConfig& cfg, int lines, int samples);

// Value of a key of the [Scene] section of a truth file; NaN when the file
// or the key is missing.
double truthValue(const std::string& truthFile, const std::string& key);

// ---- raw range lines ----------------------------------------------------

namespace raw {

// ERS-like pulse: the replica has n = round(fs T) samples taken symmetric
// about the pulse centre.
struct Pulse {
  double fs = 18.96e6;
  double T = 37.12e-6;
  double B = 15.55e6;
  double rate() const { return B / T; }
  int n() const { return static_cast<int>(std::lround(fs * T)); }
  // Offset in samples of the correlation peak after the pulse start.
  double peakOffset() const { return (fs * T - (n() - 1)) / 2.0; }
  std::vector<fcomplex> replica() const {
    std::vector<fcomplex> r(n());
    for (int m = 0; m < n(); ++m) {
      const double t = (m - (n() - 1) / 2.0) / fs;
      r[m] = fcomplex(std::polar(1.0, std::numbers::pi * rate() * t * t));
    }
    return r;
  }
  // Echo of a pulse starting at two-way delay tau, amplitude a, at time t.
  dcomplex echo(double t, double tau, double a) const {
    const double u = t - tau;
    if (u < 0.0 || u > T) return 0.0;
    const double v = u - T / 2.0;
    return a * std::polar(1.0, std::numbers::pi * rate() * v * v);
  }
};

struct Target {
  int peak;  // expected output sample
  double amplitude;
};

struct Scene {
  Pulse pulse;
  int lines = 40;
  int samples = 2048;
  double swstMin = 5.5e-3;
  int maxShift = 50;
  std::vector<int> shifts;  // per line, samples after SWST_MIN
  std::vector<Target> targets{{200, 1.0}, {1100, 0.5}};

  double swstMax() const { return swstMin + maxShift / pulse.fs; }
  double tauOf(const Target& g) const {
    return swstMin + (g.peak - pulse.peakOffset()) / pulse.fs;
  }
  std::vector<fcomplex> line(int l) const {
    std::vector<fcomplex> x(samples);
    const double swst = swstMin + shifts[l] / pulse.fs;
    for (int k = 0; k < samples; ++k) {
      dcomplex s = 0.0;
      for (const auto& g : targets) s += pulse.echo(swst + k / pulse.fs, tauOf(g), g.amplitude);
      x[k] = fcomplex(s);
    }
    return x;
  }
  // Raw raster with the SWST float prefix; `samplePrefix` writes the prefix
  // in samples instead of seconds (the in-core rule).
  void write(const std::string& path, bool samplePrefix = false) const {
    std::ofstream f(path, std::ios::binary);
    for (int l = 0; l < lines; ++l) {
      const double swst = swstMin + shifts[l] / pulse.fs;
      const float prefix = static_cast<float>(samplePrefix ? swst * pulse.fs : swst);
      f.write(reinterpret_cast<const char*>(&prefix), sizeof prefix);
      auto x = line(l);
      f.write(reinterpret_cast<const char*>(x.data()), sizeof(fcomplex) * x.size());
    }
  }
  RangeFocParams params(const std::string& in, const std::string& out) const {
    RangeFocParams p;
    p.inputFile = in;
    p.outputFile = out;
    p.fs = pulse.fs;
    p.swstMin = swstMin;
    p.swstMax = swstMax();
    p.prf = 1679.9;
    p.lines = lines;
    p.samples = samples;
    return p;
  }
};

inline Scene makeScene() {
  Scene s;
  s.shifts.assign(s.lines, 0);
  for (int l = 20; l < s.lines; ++l) s.shifts[l] = 37;  // SWST change mid-scene
  s.shifts[25] = 50;                                    // exactly D is accepted
  s.shifts[3] = 12;
  return s;
}

}  // namespace raw

// ---- range-compressed point targets -------------------------------------

namespace compressed {

constexpr double kC = 299792458.0;
constexpr double kPi = std::numbers::pi;

inline double sinc(double u) { return u == 0.0 ? 1.0 : std::sin(kPi * u) / (kPi * u); }

struct Geometry {
  double fc = 5.3e9;
  double frg = 18.96e6;
  double prf = 1679.9;
  double V = 7100.0;
  double La = 10.0;    // antenna length, m
  double B = 15.55e6;  // range bandwidth
  double dc = 300.0;   // Doppler centroid, Hz
  double nearRange = 830e3;
  int samples = 512;
  int lines = 6792;
  // Relative change per second of the speed of the targets' range
  // histories, along their beam-centre time (an orbit's drift, 0 here).
  double drift = 0.0;
  double lambda() const { return kC / fc; }
  // Speed of the range history of a target at zero-Doppler time t0 and
  // closest range R0, reference the scene's middle line.
  double speedOf(double t0, double R0) const {
    const double beamCentre = t0 - R0 * std::tan(squint()) / V;
    return V * (1.0 + drift * (beamCentre - 0.5 * lines / prf));
  }
  double fastStart() const { return 2.0 * nearRange / kC; }
  double squint() const { return std::asin(lambda() * dc / (2.0 * V)); }
  // Doppler rate of a target seen at beam centre at delay tau.
  double rateAt(double tau) const {
    const double cs = std::cos(squint());
    return -4.0 * V * V * cs * cs / (lambda() * kC * tau);
  }
  // Rate polynomial about tref (constant, linear, quadratic): the Taylor
  // series of rateAt, exact to (x/tref)^3.
  void ratePoly(double tref, double& f0, double& f1, double& f2) const {
    const double a = rateAt(tref) * tref;
    f0 = a / tref;
    f1 = -a / (tref * tref);
    f2 = a / (tref * tref * tref);
  }
  // Two-way amplitude pattern at Doppler f.
  double pattern(double f) const {
    const double th = std::asin(f * lambda() / (2.0 * V));
    const double s = sinc(La / lambda() * std::sin(th - squint()));
    return s * s;
  }
};

struct Target {
  double t0;  // zero-Doppler time, s (line 0 at time 0)
  double R0;  // closest range, m
  double amp = 1.0;
};

// Range-compressed raster (lines x samples): each line is the band-limited
// echo rect(B) in range frequency with the delay 2R/c and the carrier phase
// -4 pi R / lambda, weighted by the two-way pattern; echoes are kept within
// the PRF band around the centroid.
inline std::vector<fcomplex> simulate(const Geometry& g, const std::vector<Target>& targets) {
  const int N = g.samples;
  std::vector<fcomplex> img(static_cast<std::size_t>(g.lines) * N, fcomplex(0.0f, 0.0f));
  std::vector<std::complex<double>> lineSpectrum(N);
  FFTBuffer line(N);
  const double lam = g.lambda();
  for (int n = 0; n < g.lines; ++n) {
    const double t = n / g.prf;
    std::fill(lineSpectrum.begin(), lineSpectrum.end(), std::complex<double>(0.0, 0.0));
    bool any = false;
    for (const Target& tg : targets) {
      const double dt = t - tg.t0;
      const double V = g.speedOf(tg.t0, tg.R0);
      const double R = std::sqrt(tg.R0 * tg.R0 + V * V * dt * dt);
      const double fd = -2.0 * V * V * dt / (lam * R);
      if (std::fabs(fd - g.dc) >= 0.5 * g.prf) continue;
      const double a = tg.amp * g.pattern(fd);
      const double tau = 2.0 * R / kC - g.fastStart();
      const double carrier = -4.0 * kPi * R / lam;
      for (int m = 0; m < N; ++m) {
        const double f = (m < N / 2 ? m : m - N) * g.frg / N;
        if (std::fabs(f) > g.B / 2.0) continue;
        lineSpectrum[m] += std::polar(a, carrier - 2.0 * kPi * f * tau);
      }
      any = true;
    }
    if (!any) continue;
    for (int m = 0; m < N; ++m) line[m] = fcomplex(lineSpectrum[m]);
    fft_c(N, N, 1, 1, FFT_BACKWARD_NORMALISED, FFT_NONE, line.data(), line.data());
    std::copy(line.begin(), line.end(), img.begin() + static_cast<std::ptrdiff_t>(n) * N);
  }
  return img;
}

// Scenes focused through the azimuth block driver.

// Configuration of the point-target scenes: 4096-line blocks with a full
// azimuth overlap of 1400 lines (longer than the 1314-line aperture),
// 256-sample range sub-blocks with a full overlap of 64.
inline AzimuthFocusConf sceneConf(const Geometry& g, int interp = 0, double pad = 0.0) {
  AzimuthFocusConf c;
  c.PerformInterpolation = interp;
  c.StoltPadding = pad;
  c.AntennaLength = g.La;
  c.WhiteningFlag = 0;
  c.RangeWindowHammingParameter = 0.75;
  c.AzimuthWindowHammingParameter = 0.6;
  c.RangeLookBandwidth = g.B;
  c.RangeTransitionBandwidth = g.B;
  c.AzimuthLookBandwidth = 0.8 * g.prf;
  c.AzimuthTransitionBandwidth = 0.8 * g.prf;
  c.SamplesInBlock = 256;
  c.LinesInBlock = 4096;
  c.RangeOverlap = 32;
  c.AzimuthOverlap = 700;
  c.ApplyAzShift = g.lines;    // automatic
  c.ApplyRgShift = g.samples;  // automatic
  return c;
}

inline void fillScene(const Geometry& g, AzimuthFocusFiles& files, AzimuthFocusScene& scene) {
  files.frg_hz = g.frg;
  files.fc_hz = g.fc;
  files.prf_hz = g.prf;
  files.FastStartTime = g.fastStart();
  files.bandwidth_hz = g.B;
  files.SlowStartTime = 0.0;
  scene.samples = g.samples;
  scene.lines = g.lines;
  const double tref = g.fastStart() + 0.5 * g.samples / g.frg;
  scene.polyDC[0] = g.dc;
  scene.polyDC[7] = tref;
  scene.polyDC[8] = 0.0;
  g.ratePoly(tref, scene.polyFR[0], scene.polyFR[1], scene.polyFR[4]);
  // and the cubic term of the series, which a swath of thousands of
  // samples needs three PRFs from zero Doppler (without it the rate is off
  // by 1e-5 at the edges of 4800 samples, 25 degrees of phase there).
  scene.polyFR[5] = -scene.polyFR[0] / (tref * tref * tref);
  scene.polyFR[7] = tref;
  // The rate goes with V^2 cos^2(squint) = V^2 - v^2.
  const double v = g.V * std::sin(g.squint());
  const double perSecond = 2.0 * g.V * g.V * g.drift / (g.V * g.V - v * v);
  scene.polyFR[2] = scene.polyFR[0] * perSecond;
  scene.polyFR[3] = scene.polyFR[1] * perSecond;
  scene.polyFR[8] = 0.5 * g.lines / g.prf;
}

// Output pixels (row, col) of the targets, placed in the middle of blocks and
// sub-blocks and on their seams (output row 2696, output columns 192, 384).
inline const double kPixels[][2] = {{1000.3, 100.2},  {2695.6, 191.7}, {2000.0, 384.4},
                             {4000.7, 300.5},  {2696.2, 50.0},  {3500.4, 250.3},
                             {4700.1, 400.0}};

// Targets whose zero-Doppler positions fall near kPixels, given the
// annotation of a focused scene.
inline std::vector<Target> placeTargets(const Geometry& g, double firstLine, double firstSample) {
  std::vector<Target> t;
  for (const auto& p : kPixels)
    t.push_back({firstLine + p[0] / g.prf, (firstSample + p[1] / g.frg) * kC / 2.0, 1.0});
  return t;
}

}  // namespace compressed

// ---- range-compressed clutter --------------------------------------------

namespace clutter {

struct Radar {
  double fc = 5.3e9;
  double fs = 18.96e6;
  double prf = 1680.0;
  double antenna = 10.0;
  double velocity = 7100.0;
  double range0 = 850e3;       // slant range, m
  double bandFraction = 0.82;  // range band as a fraction of fs
};

// Clutter whose Doppler spectrum is centred on an absolute centroid.
struct ClutterScene : Radar {
  ClutterScene() { bandFraction = 0.8; }
  double dcPrf = 1.3;      // absolute Doppler centroid, PRF units
  double snrDb = 30.0;     // clutter to noise power
  int points = 0;          // bright point scatterers added to the clutter
  double pointAmp = 30.0;  // their amplitude against a clutter cell of unit power
  unsigned seed = 7;
};

// Centroid in PRF units: f0 + perSample * r + perLine * l.
struct Centroid {
  double f0 = 0.3;
  double perSample = 0.0;
  double perLine = 0.0;
  double at(double r, double l) const { return f0 + perSample * r + perLine * l; }
};

// White reflectivity through the two-dimensional transfer function of a
// side-looking radar (range band, two-way sinc^2 antenna pattern around the
// absolute centroid with its aliases, range-Doppler phase with range
// migration), unit clutter power, plus receiver noise: `lines` rows of
// `samples` samples. For the ambiguity estimators.
std::vector<fcomplex> makeClutter(const ClutterScene& sc, int samples, int lines);
// The same for the radar `rd`, with `points` scatterers of amplitude `pointAmp`.
std::vector<fcomplex> makeClutter(const Radar& rd, double dcPrf, int samples, int lines, double snrDb,
                                  unsigned seed, int points = 0, double pointAmp = 0.0);

// Azimuth lines of a moving-average process whose autocorrelation is that of
// the two-way antenna pattern, modulated to a centroid varying linearly in
// range and azimuth, plus white noise at snrDb. Exact second-order
// statistics, no range migration: for the fractional centroid.
std::vector<fcomplex> makeVaryingClutter(const Radar& rd, const Centroid& dc, int samples, int lines,
                                         double snrDb, unsigned seed);

// Writes a FLOAT_COMPLEX raster, little-endian (byteOrder 0) or big-endian (1).
bool writeRaster(const std::string& path, const std::vector<fcomplex>& data, int byteOrder = 0);

// Estimation state with ERS-like settings, scaled to small test rasters
// (blocks of `blocks` samples x `blockl` lines).
DcEstState ersState(const Radar& rd, int blocks = 64, int blockl = 256);
// Input record of a raster written by the test.
DcEstInput inputFor(const Radar& rd, const std::string& path, const std::string& dir, int samples, int lines);
// Centroid of a Hz polynomial (range time from the first sample, azimuth
// time from the first line) at sample r, line l, in PRF units.
double polyPrf(const double poly[7], const Radar& rd, double r, double l);
// Wrapped to (-1/2, 1/2].
double wrapHalf(double v);

}  // namespace clutter

}  // namespace support
