#include "core/azimuth_centre_estimate.h"

#include <cmath>
#include <complex>
#include <cstddef>
#include <new>
#include <string>

#include "base/constants.h"
#include "base/status.h"
#include "core/fft.h"
#include "diag/report.h"

namespace {

// Group of lines per energy sample: the largest of 8, 4, 2 that keeps at
// least 512 samples, else every line.
int groupSize(int nAzimuth) {
  for (int g : {8, 4, 2})
    if (nAzimuth / g >= 512) return g;
  return 1;
}

}  // namespace

int EnPhaseAzCntrlWNestimate(double& value, int nRange, int nAzimuth, int nInner,
                             const float* data, double step, double scale) {
  if (!data || nRange < 1 || nAzimuth < 1 || nInner < 1 || nAzimuth > nRange) {
    ORV_REPORT("Azimuth centre estimate: bad block (lines " + std::to_string(nAzimuth) +
                   ", rows " + std::to_string(nRange) + ", samples " + std::to_string(nInner) +
                   ")",
               REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  const double L = 2.0 * consts::kPi * step / scale;
  if (!std::isfinite(L) || L == 0.0) {
    ORV_REPORT("Azimuth centre estimate: bad step or scale", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  const int g = groupSize(nAzimuth);
  const int n = nAzimuth / g;
  if (n < 2) {
    ORV_REPORT("Azimuth centre estimate: block too short for a first harmonic", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }

  FFTBuffer energy;
  try {
    energy.assign(static_cast<std::size_t>(n), fcomplex(0.0f, 0.0f));
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Azimuth centre estimate: out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  // Energy of every g-th line, the first one left out (it repeats the second).
  for (int k = 1; k < n; ++k) {
    const float* x = data + 2 * static_cast<std::size_t>(k) * g * nInner;
    double e = 0.0;
    for (int i = 0; i < nInner; ++i) {
      const double re = x[2 * i], im = x[2 * i + 1];
      e += re * re + im * im;
    }
    energy[k] = fcomplex(static_cast<float>(e), 0.0f);
  }
  energy[0] = energy[1];

  if (fft_c(n, n, 1, 1, FFT_FORWARD, FFT_NONE, energy.data(), energy.data()) != 0) {
    ORV_REPORT_CALLED_ERROR();
    return STATUS_BAD_CONDITION;
  }
  // A pattern without a first harmonic has no phase; take 0 rather than the
  // sign-of-zero lottery of atan2.
  const fcomplex h1 = energy[1];
  const double p = (h1.real() == 0.0f && h1.imag() == 0.0f)
                       ? 0.0
                       : std::atan2(static_cast<double>(h1.imag()), static_cast<double>(h1.real()));

  double d = std::fmod(p * L / (-2.0 * consts::kPi) - value, L);
  if (d > L / 2) d -= L;
  if (d < -L / 2) d += L;
  value += d;
  return STATUS_OK;
}
