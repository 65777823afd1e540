#include "scenes.h"

#include <algorithm>
#include <bit>
#include <cstring>
#include <random>

namespace support {

SceneDescription ersScene(int lines, int samples, double dopplerHz) {
  SceneDescription s;
  s.mission = "ERS2";
  s.orbit.semiMajorAxis = 7159500.0;
  s.orbit.eccentricity = 0.0011;
  s.orbit.inclinationDeg = 98.52;
  s.orbit.nodeLongitudeDeg = 0.0;
  s.orbit.argPerigeeDeg = 90.0;
  s.orbit.meanAnomalyDeg = -50.0;
  double start = 0.0;
  simParseDate("18-JAN-2010 17:49:28.683", start);
  s.orbit.epoch = start;
  s.startTime = start;
  s.lines = lines;
  s.samples = samples;
  s.nearRangeTime = 0.00555;
  s.dopplerCentroidHz = dopplerHz;
  s.orbitNumber = 77106;
  s.frame = 2925;
  s.arcNumber = 123;
  s.sceneDir = "ERS2_SIM";
  s.clutterSigma = 2.0;
  s.noiseSigma = 1.0;
  s.seed = 11;
  return s;
}

SensorScene ersSceneFiles(const RawSceneSimulator& sim, const std::string& folder) {
  SensorScene out;
  out.root = folder + "sim";
  out.truth = out.root + "/truth.txt";
  out.files = {{"image", sim.imagePath(out.root)},
               {"leader", sim.leaderPath(out.root)},
               {"orbit", sim.odrPath(out.root)},
               {"orbit_archive", out.root + "/orbits"}};
  return out;
}

bool simulateErs(const SceneDescription& scene, const std::string& folder, SensorScene& out,
                 std::string& error) {
  try {
    const RawSceneSimulator sim(scene);
    out = ersSceneFiles(sim, folder);
    return sim.writeErsScene(out.root, error) == 0;
  } catch (const std::exception& e) {
    error = e.what();
    return false;
  }
}

SceneDescription envisatScene(const AsarSimConfig& cfg, int lines, int samples, double dopplerHz) {
  SceneDescription s = ersScene(lines, samples, dopplerHz);
  s.orbitNumber = cfg.absoluteOrbit;
  applyAsarInstrument(cfg, s);
  return s;
}

SceneDescription palsarScene(const PalsarSimConfig& cfg, int lines, int samples) {
  SceneDescription s = ersScene(lines, samples, 0.0);
  s.nearRangeTime = 0.00567;
  s.clutterSigma = 1.0;
  s.noiseSigma = 0.5;
  s.orbitNumber = 12345;
  applyPalsarInstrument(cfg, s);
  return s;
}

bool simulateEnvisat(const SceneDescription& scene, const AsarSimConfig& cfg, const std::string& folder,
                     SensorScene& out, std::string& error) {
  try {
    const RawSceneSimulator sim(scene);
    AsarSceneFiles files;
    out = SensorScene{};
    out.root = folder + "sim";
    out.truth = out.root + "/truth.txt";
    if (writeEnvisatScene(sim, cfg, out.root, &files, error) != 0) return false;
    out.files = {{"image", files.level0}, {"ins", files.ins},         {"xca", files.xca},
                 {"xch", files.xch},      {"orbit", files.orbit},     {"aux_dir", files.auxDir},
                 {"orbit_dir", files.orbitDir}};
    return true;
  } catch (const std::exception& e) {
    error = e.what();
    return false;
  }
}

double truthValue(const std::string& truthFile, const std::string& key) {
  SimIni ini;
  std::string error;
  if (!ini.load(truthFile, error)) return std::nan("");
  return ini.getDouble("Scene", key, std::nan(""));
}

namespace clutter {

namespace {

double bspline3(double x) {
  const double a = std::fabs(x);
  if (a <= 1.0) return 2.0 / 3.0 - a * a + a * a * a / 2.0;
  if (a < 2.0) return 4.0 / 3.0 - 2.0 * a + a * a - a * a * a / 6.0;
  return 0.0;
}

// Taps g0, g1, g2 of the causal filter whose output autocorrelation is
// B(0), B(x), B(2x), x = 2 V / (L PRF) (spectral factorisation of the MA(2)
// autocorrelation, roots inside the unit circle).
std::vector<double> antennaTaps(const Radar& rd) {
  const double x = 2.0 * rd.velocity / (rd.antenna * rd.prf);
  const double b0 = bspline3(0.0), b1 = bspline3(x), b2 = bspline3(2.0 * x);
  using C = std::complex<double>;
  std::vector<C> zs;
  if (b2 > 1e-12) {
    // b2 (z^2 + z^-2) + b1 (z + z^-1) + b0 = 0 with y = z + 1/z.
    const C disc = std::sqrt(C(b1 * b1 - 4.0 * b2 * (b0 - 2.0 * b2)));
    for (C y : {(-b1 + disc) / (2.0 * b2), (-b1 - disc) / (2.0 * b2)}) {
      const C d = std::sqrt(y * y - 4.0);
      C z = (y + d) / 2.0;
      if (std::abs(z) > 1.0) z = (y - d) / 2.0;
      zs.push_back(z);
    }
  } else if (b1 > 1e-12) {
    const C d = std::sqrt(C(b0 * b0 - 4.0 * b1 * b1));
    C z = (-b0 + d) / (2.0 * b1);
    if (std::abs(z) > 1.0) z = (-b0 - d) / (2.0 * b1);
    zs.push_back(z);
  }
  // (1 - z1 w)(1 - z2 w) with w the unit delay.
  std::vector<C> g{1.0};
  for (C z : zs) {
    std::vector<C> h(g.size() + 1, 0.0);
    for (size_t i = 0; i < g.size(); ++i) {
      h[i] += g[i];
      h[i + 1] -= z * g[i];
    }
    g = h;
  }
  double e = 0.0;
  for (C v : g) e += std::norm(v);
  std::vector<double> taps;
  for (C v : g) taps.push_back(v.real() * std::sqrt(b0 / e));
  return taps;
}

}  // namespace

std::vector<fcomplex> makeVaryingClutter(const Radar& rd, const Centroid& dc, int samples, int lines,
                                         double snrDb, unsigned seed) {
  const std::vector<double> g = antennaTaps(rd);
  const int nt = static_cast<int>(g.size());
  std::mt19937 rng(seed);
  std::normal_distribution<double> n01(0.0, std::sqrt(0.5));
  auto cgauss = [&] { return std::complex<double>(n01(rng), n01(rng)); };
  const size_t ns = static_cast<size_t>(samples);
  // Ring of the last nt reflectivity lines.
  std::vector<std::complex<double>> w(static_cast<size_t>(nt) * ns);
  for (auto& v : w) v = cgauss();
  const double noise = std::sqrt(bspline3(0.0) * std::pow(10.0, -snrDb / 10.0));
  std::vector<fcomplex> out(ns * static_cast<size_t>(lines));
  for (int l = 0; l < lines; ++l) {
    const int cur = l % nt;
    for (size_t r = 0; r < ns; ++r) w[static_cast<size_t>(cur) * ns + r] = cgauss();
    for (size_t r = 0; r < ns; ++r) {
      const double f = dc.at(static_cast<double>(r), l);
      const std::complex<double> step = std::polar(1.0, 2.0 * std::numbers::pi * f);
      std::complex<double> rot = 1.0, acc = 0.0;
      for (int k = 0; k < nt; ++k) {
        const int row = ((l - k) % nt + nt) % nt;
        acc += g[static_cast<size_t>(k)] * rot * w[static_cast<size_t>(row) * ns + r];
        rot *= step;
      }
      acc += noise * cgauss();
      out[static_cast<size_t>(l) * ns + r] = fcomplex(acc);
    }
  }
  return out;
}


std::vector<fcomplex> makeClutter(const ClutterScene& sc, int samples, int lines) {
  const double c = 299792458.0;
  const double pi = std::numbers::pi;
  std::mt19937 rng(sc.seed);
  std::normal_distribution<float> n01(0.0f, 1.0f);
  FFTBuffer data(static_cast<size_t>(samples) * lines);
  for (auto& v : data) v = fcomplex(n01(rng), n01(rng)) * static_cast<float>(std::sqrt(0.5));
  std::uniform_int_distribution<size_t> where(0, data.size() - 1);
  std::uniform_real_distribution<double> phase(0.0, 2.0 * std::numbers::pi);
  for (int i = 0; i < sc.points; ++i) {
    const size_t at = where(rng);
    data[at] += fcomplex(std::polar(sc.pointAmp, phase(rng)));
  }
  fft_c(samples, samples, lines, lines, FFT_FORWARD, FFT_FORWARD, data.data(), data.data());
  const double fdc = sc.dcPrf * sc.prf;
  const double k2 = std::pow(c / (2.0 * sc.velocity), 2);
  auto sinc = [pi](double x) { return std::fabs(x) < 1e-12 ? 1.0 : std::sin(pi * x) / (pi * x); };
  for (int q = 0; q < lines; ++q) {
    const double fq = (q < lines / 2 ? q : q - lines) * sc.prf / lines;
    for (int k = 0; k < samples; ++k) {
      const double fr = (k < samples / 2 ? k : k - samples) * sc.fs / samples;
      fcomplex& v = data[static_cast<size_t>(q) * samples + k];
      if (std::fabs(fr) > sc.bandFraction * sc.fs / 2.0) {
        v = 0.0f;
        continue;
      }
      const double f0 = sc.fc + fr;
      const double centre = fdc * f0 / sc.fc;  // the beam centre scales with frequency
      const double base = fq + std::round((centre - fq) / sc.prf) * sc.prf;
      std::complex<double> h = 0.0;
      for (int m = -2; m <= 2; ++m) {
        const double fa = base + m * sc.prf;
        const double s = sinc(sc.antenna * (fa - centre) * sc.fc / (2.0 * sc.velocity * f0));
        // Range-Doppler phase less the bulk delay, in a cancellation-free form.
        const double dq = -k2 * fa * fa / (std::sqrt(f0 * f0 - k2 * fa * fa) + f0);
        h += s * s * std::polar(1.0, -4.0 * pi * sc.range0 / c * dq);
      }
      v *= fcomplex(h);
    }
  }
  fft_c(samples, samples, lines, lines, FFT_BACKWARD_NORMALISED, FFT_BACKWARD_NORMALISED,
        data.data(), data.data());
  // Noise against the clutter power alone (the reflectivity had unit power).
  double p = 0.0;
  for (const auto& v : data) p += std::norm(v);
  p /= static_cast<double>(data.size());
  const double pointPower = double(sc.points) * sc.pointAmp * sc.pointAmp / double(data.size());
  const float scale = static_cast<float>(1.0 / std::sqrt(p / (1.0 + pointPower)));
  const float noise = static_cast<float>(std::sqrt(std::pow(10.0, -sc.snrDb / 10.0) / 2.0));
  std::vector<fcomplex> out(data.size());
  for (size_t i = 0; i < data.size(); ++i) out[i] = data[i] * scale + noise * fcomplex(n01(rng), n01(rng));
  return out;
}

std::vector<fcomplex> makeClutter(const Radar& rd, double dcPrf, int samples, int lines, double snrDb,
                                  unsigned seed, int points, double pointAmp) {
  ClutterScene sc;
  static_cast<Radar&>(sc) = rd;
  sc.dcPrf = dcPrf;
  sc.snrDb = snrDb;
  sc.seed = seed;
  sc.points = points;
  sc.pointAmp = pointAmp;
  return makeClutter(sc, samples, lines);
}

bool writeRaster(const std::string& path, const std::vector<fcomplex>& data,
                        int byteOrder) {
  std::ofstream f(path, std::ios::binary);
  if (!f) return false;
  const bool hostLittle = std::endian::native == std::endian::little;
  const bool swap = (byteOrder == 1) == hostLittle;
  if (!swap) {
    f.write(reinterpret_cast<const char*>(data.data()),
            static_cast<std::streamsize>(data.size() * sizeof(fcomplex)));
  } else {
    std::vector<char> buf(data.size() * sizeof(fcomplex));
    std::memcpy(buf.data(), data.data(), buf.size());
    for (size_t i = 0; i < buf.size(); i += 4) std::reverse(buf.begin() + i, buf.begin() + i + 4);
    f.write(buf.data(), static_cast<std::streamsize>(buf.size()));
  }
  return static_cast<bool>(f);
}

// Estimation state with ERS-like settings, scaled to small test rasters.
DcEstState ersState(const Radar& rd, int blocks, int blockl) {
  DcEstState st;
  st.blocks = blocks;
  st.blockl = blockl;
  st.memory = int64_t(64) << 20;
  st.nBest = 10;
  st.nWdar = 5;
  st.nMlbf = 8;
  st.anLen = rd.antenna;
  st.rgBand = 0.72;
  st.fc = rd.fc;
  st.fs = rd.fs;
  st.maxAmb = 5.0;
  st.minAmb = -5.0;
  st.kThr = 2.15;
  st.sThr = 20.0;
  st.varTh = 0.5;
  st.lookBf = 0.25;
  st.lookBt = 0.1;
  st.lookRp = 0.05;
  st.lookRs = 0.05;
  st.fLength = 21;
  st.decFac = 3;
  st.dftStep = 0.00004;
  st.peakWid = 0.0056;
  st.ambFlag = 0;
  st.patchs = 8;
  st.patchl = 32;
  st.fftRgPrc = 0.0005;
  st.fftAzPrc = 0.0005;
  st.geomDoppler = 0.0;
  st.dswst = 0;
  return st;
}

// Input record for a raster written by the test.
DcEstInput inputFor(const Radar& rd, const std::string& path, const std::string& dir,
                           int samples, int lines) {
  DcEstInput in;
  in.rasterFile = path;
  in.outDir = dir;
  in.samples = samples;
  in.lines = lines;
  in.prf = rd.prf;
  in.velocity = rd.velocity;
  return in;
}

// Centroid of a Hz polynomial (range time from the first sample, azimuth
// time from the first line) at sample r, line l, in PRF units.
double polyPrf(const double poly[7], const Radar& rd, double r, double l) {
  const double t = r / rd.fs, u = l / rd.prf;
  const double hz = poly[0] + poly[1] * t + poly[2] * u + poly[3] * t * u + poly[4] * t * t +
                    poly[5] * t * t * t + poly[6] * t * t * t * t;
  return hz / rd.prf;
}

// Wrapped to (-1/2, 1/2].
double wrapHalf(double v) {
  double w = v - std::floor(v);
  if (w > 0.5) w -= 1.0;
  return w;
}

}  // namespace clutter

}  // namespace support
