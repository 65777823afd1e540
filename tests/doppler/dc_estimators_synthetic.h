#pragma once
// Range-compressed stripmap clutter for the Doppler estimator tests: white
// reflectivity filtered by the two-dimensional transfer function of a
// C-band side-looking radar (range band, two-way sinc^2 azimuth antenna
// pattern centred on a given absolute Doppler centroid, range-Doppler phase
// with its range migration), plus receiver noise. Bright point scatterers
// may be added: the beat of two range looks is only coherent on them.
#include <cmath>
#include <complex>
#include <numbers>
#include <random>
#include <vector>

#include "base/fcomplex.h"
#include "core/fft.h"
#include "doppler/dc_state.h"

struct ClutterScene {
  double fc = 5.3e9;       // carrier, Hz
  double fs = 18.96e6;     // range sampling rate, Hz
  double prf = 1680.0;     // Hz
  double antenna = 10.0;   // antenna length, m
  double velocity = 7100.0;
  double range0 = 850e3;   // slant range, m
  double bandFraction = 0.8;  // range band, fraction of fs
  double dcPrf = 1.3;      // absolute Doppler centroid, PRF units
  double snrDb = 30.0;     // clutter to noise power
  int points = 0;          // bright point scatterers added to the clutter
  double pointAmp = 30.0;  // their amplitude against a clutter cell of unit power
  unsigned seed = 7;
};

inline double clutterSinc(double x) {
  if (std::fabs(x) < 1e-12) return 1.0;
  const double a = std::numbers::pi * x;
  return std::sin(a) / a;
}

// `lines` rows of `samples` range samples.
inline std::vector<fcomplex> makeClutter(const ClutterScene& sc, int samples, int lines) {
  const double c = 299792458.0;
  std::mt19937 rng(sc.seed);
  std::normal_distribution<float> g(0.0f, 1.0f);
  FFTBuffer data(static_cast<std::size_t>(samples) * lines);
  for (auto& v : data) v = fcomplex(g(rng), g(rng));
  std::uniform_int_distribution<int> px(0, samples - 1), py(0, lines - 1);
  std::uniform_real_distribution<double> ph(0.0, 2.0 * std::numbers::pi);
  for (int i = 0; i < sc.points; ++i) {
    const double a = ph(rng);
    data[static_cast<std::size_t>(py(rng)) * samples + px(rng)] +=
        static_cast<float>(sc.pointAmp) * fcomplex(static_cast<float>(std::cos(a)), static_cast<float>(std::sin(a)));
  }
  fft_c(samples, samples, lines, lines, FFT_FORWARD, FFT_FORWARD, data.data(), data.data());
  const double fdc = sc.dcPrf * sc.prf;
  for (int q = 0; q < lines; ++q) {
    const double fq = static_cast<double>(q) * sc.prf / lines;
    for (int k = 0; k < samples; ++k) {
      const double fr = (k < samples / 2 ? k : k - samples) * sc.fs / samples;
      fcomplex& v = data[static_cast<std::size_t>(q) * samples + k];
      if (std::fabs(fr) > sc.bandFraction * sc.fs / 2.0) {
        v = 0.0f;
        continue;
      }
      const double centre = fdc * (1.0 + fr / sc.fc);
      // Azimuth frequency of this bin nearest to the centre of the beam.
      const double fa = fq + std::round((centre - fq) / sc.prf) * sc.prf;
      const double s = clutterSinc(sc.antenna * (fa - centre) / (2.0 * sc.velocity));
      const double arg = (sc.fc + fr) * (sc.fc + fr) - std::pow(c * fa / (2.0 * sc.velocity), 2);
      const double phase = -4.0 * std::numbers::pi * sc.range0 / c * std::sqrt(arg);
      v *= static_cast<float>(s * s) * fcomplex(static_cast<float>(std::cos(phase)),
                                                static_cast<float>(std::sin(phase)));
    }
  }
  fft_c(samples, samples, lines, lines, FFT_BACKWARD_NORMALISED, FFT_BACKWARD_NORMALISED, data.data(),
        data.data());
  double p = 0.0;
  for (const auto& v : data) p += std::norm(v);
  p /= static_cast<double>(data.size());
  const float scale = static_cast<float>(1.0 / std::sqrt(p));
  const float noise = static_cast<float>(std::sqrt(std::pow(10.0, -sc.snrDb / 10.0) / 2.0));
  std::vector<fcomplex> out(data.size());
  for (std::size_t i = 0; i < data.size(); ++i)
    out[i] = data[i] * scale + noise * fcomplex(g(rng), g(rng));
  return out;
}

// Estimation state with ERS-like look filter and search settings.
inline DcEstState ersLikeState(const ClutterScene& sc) {
  DcEstState st;
  st.blocks = 256;
  st.blockl = 2048;
  st.nMlbf = 8;
  st.anLen = sc.antenna;
  st.rgBand = 0.72;
  st.fc = sc.fc;
  st.fs = sc.fs;
  st.minAmb = -5.0;
  st.maxAmb = 5.0;
  st.varTh = 0.5;
  st.lookBf = 0.25;
  st.lookBt = 0.1;
  st.lookRp = 0.05;
  st.lookRs = 0.05;
  st.fLength = 21;
  st.decFac = 3;
  st.dftStep = 0.00004;
  st.peakWid = 0.0056;
  st.patchs = 8;
  st.patchl = 32;
  return st;
}
