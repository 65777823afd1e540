#pragma once
// Synthetic raw rasters of point echoes for the range focusing tests.
#include <cmath>
#include <fstream>
#include <numbers>
#include <string>
#include <vector>

#include "base/fcomplex.h"
#include "core/range_focus.h"

namespace synthetic_raw {

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

}  // namespace synthetic_raw
