// Omega-K focusing of one azimuth block: equivalent geometry, wavenumber
// grids, windows and the kernel without Stolt interpolation, plus the range
// sub-blocking walk over a block.
#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <new>
#include <vector>

#include "base/constants.h"
#include "base/status.h"
#include "core/azimuth_block.h"
#include "core/fft.h"
#include "core/stolt_interpolation.h"
#include "diag/report.h"
#include "diag/waitbar.h"

namespace {

constexpr double kC = consts::kSpeedOfLight;
constexpr double kHalfC = consts::kSpeedOfLight / 2.0;
constexpr double kQuarterC = consts::kSpeedOfLight / 4.0;
constexpr double kFourPi = 4.0 * consts::kPi;
constexpr double kTwoPi = 2.0 * consts::kPi;
constexpr double kPi = consts::kPi;

double rateAt(const AzimuthBlockPar& par, double t) {
  const double x = t - par.trg0;
  return par.fr0 + x * (par.fr1 + x * (par.fr2 + x * par.fr3));
}

double sinc(double u) {
  if (u == 0.0) return 1.0;
  const double a = kPi * u;
  return wk_sin(a) / a;
}

// Pattern term with sin(sq - asin(x)) = sin(sq) sqrt(1 - x^2) - cos(sq) x,
// which spares the arcsines and sines of the direct form.
double patternTerm(double L, double ssq, double csq, double k, double kx, double Bx) {
  const double xc = kx / k, xm = (kx - Bx) / k, xp = (kx + Bx) / k;
  const double sc = sinc(L * (ssq * std::sqrt(1.0 - xc * xc) - csq * xc));
  const double sm = sinc(L * (ssq * std::sqrt(1.0 - xm * xm) - csq * xm));
  const double sp = sinc(L * (ssq * std::sqrt(1.0 - xp * xp) - csq * xp));
  const double sc2 = sc * sc, sm2 = sm * sm, sp2 = sp * sp;
  return sc2 * sc2 + sm2 * sm2 + sp2 * sp2;
}

double squintOf(const AzimuthBlockPar& par) {
  return std::asin(kC / par.fc * par.dc / 2.0 / par.Veq);
}

}  // namespace

int MyComputeEqPar(AzimuthBlockPar& par) {
  const double T = par.samples / par.frg;
  const double lambda = kC / par.fc;
  const double fn = rateAt(par, par.t0);
  const double ff = rateAt(par, par.t0 + T);
  if (!(fn != 0.0 && ff != 0.0 && fn != ff)) {
    ORV_REPORT("Doppler rate does not vary over the block: equivalent geometry undefined",
               REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  const double v = par.dc * lambda / 2.0;
  par.Veq = std::sqrt(v * v + lambda * T * kQuarterC / (1.0 / fn - 1.0 / ff));
  const double cs = std::cos(std::asin(v / par.Veq));
  par.Req = -T * cs * kHalfC / (1.0 - fn / ff);
  if (par.interp == 0) par.Req += cs * (par.samples / 2) * kC / (2.0 * par.frg);
  return STATUS_OK;
}

void ComputeWaveNumbers(const AzimuthBlockPar& par, double& k0, double& kx, double& kz) {
  k0 = kFourPi * par.fc / kC;
  kx = kTwoPi * (par.dcref != 0.0 ? par.dcref : par.dc) / par.Veq;
  kz = std::sqrt(k0 * k0 - kx * kx);
}

void WindowPars(AzimuthBlockPar& par, double& aperture, double& a, double& b, double& c,
                double& d) {
  const double kxd = kTwoPi * par.dc / par.Veq;
  const double Bx = kTwoPi * par.prf / par.Veq;
  const double Bk = kFourPi * par.frg / kC;
  const double k0 = kFourPi * par.fc / kC;
  aperture = std::fabs(std::asin((kxd + Bx / 2.0) / (k0 - Bk / 2.0)) -
                       std::asin((kxd - Bx / 2.0) / (k0 + Bk / 2.0)));
  a = b = c = d = 0.0;
  if (par.prf < par.azlook) {
    par.azw = 0.0;
    std::fprintf(stderr, "Wrong azimuth hamming window parameters: no window applied.\n");
  } else {
    a = (par.azlook - par.aztrans) / 2.0 / par.prf;
    b = par.aztrans / 2.0 / par.prf;
  }
  if (par.frg < par.rglook) {
    par.rgw = 0.0;
    std::fprintf(stderr, "Wrong range hamming window parameters: no window applied. \n");
  } else {
    c = (par.rglook - par.rgtrans) / 2.0 / par.frg;
    d = par.rgtrans / 2.0 / par.frg;
  }
}

double wk_raised_cosine(double excess, double width, double pedestal) {
  if (excess <= 0.0) return 1.0;
  if (excess < width) return pedestal + (1.0 - pedestal) * std::cos(kPi * excess / width);
  return 0.0;
}

double wk_pattern_term(double L, double sq, double k, double kx, double Bx) {
  return patternTerm(L, std::sin(sq), std::cos(sq), k, kx, Bx);
}

WKWeighting::WKWeighting(AzimuthBlockPar& par) {
  WindowPars(par, aperture, a, b, c, d);
  whiten = par.whiten;
  azw = par.azw;
  rgw = par.rgw;
  active = rgw != 0.0 || azw != 0.0 || whiten != 0;
  L = par.AntennaLength * par.fc / kC;
  Bx = kTwoPi * par.prf / par.Veq;
  Bk = kFourPi * par.frg / kC;
  sq = squintOf(par);
  ssq = std::sin(sq);
  csq = std::cos(sq);
  k0 = kFourPi * par.fc / kC;
}

double WKWeighting::rangeTerm(double k) const {
  if (rgw == 0.0) return 1.0;
  return wk_raised_cosine(std::fabs(k - k0) - c * Bk, d * Bk, rgw);
}

double WKWeighting::azimuthTerm(double k, double kx, double& P) const {
  P = patternTerm(L, ssq, csq, k, kx, Bx);
  const double wh = whiten ? 1.0 / (std::sqrt(P) + 0.0001) : 1.0;
  double aw = 1.0;
  if (azw != 0.0)
    aw = wk_raised_cosine(std::fabs(sq - std::asin(kx / k)) - a * aperture, b * aperture, azw);
  return wh * aw;
}

int WKWeighting::azimuthPiece(double k, double kx) const {
  if (azw == 0.0) return 0;
  const double excess = std::fabs(sq - std::asin(kx / k)) - a * aperture;
  if (excess <= 0.0) return 0;
  return excess < b * aperture ? 1 : 2;
}

void WKWeighting::azimuthRow(const double* k, int n, double kx, double* term, double* P) const {
  constexpr int kCell = 32;
  if (n < 1) return;
  int i0 = 0;
  term[0] = azimuthTerm(k[0], kx, P[0]);
  int piece0 = azimuthPiece(k[0], kx);
  while (i0 < n - 1) {
    const int i1 = std::min(i0 + kCell, n - 1);
    term[i1] = azimuthTerm(k[i1], kx, P[i1]);
    const int piece1 = azimuthPiece(k[i1], kx);
    if (piece1 == piece0 && std::isfinite(term[i0]) && std::isfinite(term[i1])) {
      const double span = k[i1] - k[i0];
      for (int i = i0 + 1; i < i1; ++i) {
        const double f = (k[i] - k[i0]) / span;
        term[i] = term[i0] + f * (term[i1] - term[i0]);
        P[i] = P[i0] + f * (P[i1] - P[i0]);
      }
    } else {
      for (int i = i0 + 1; i < i1; ++i) term[i] = azimuthTerm(k[i], kx, P[i]);
    }
    i0 = i1;
    piece0 = piece1;
  }
}

void AzimuthGrid(const AzimuthBlockPar& par, double* kx, double* kx2, double* dk) {
  double k0, kxc, kz;
  ComputeWaveNumbers(par, k0, kxc, kz);
  const double prf = par.prf;
  const double d = par.dc - std::floor(par.dc / prf) * prf;
  const double step = prf / par.lines;
  for (int i = 0; i < par.lines; ++i) {
    const double f = i * step - d + prf / 2.0;
    const double fw = f - std::floor(f / prf) * prf - prf / 2.0 + par.dc;
    kx[i] = fw * kTwoPi / par.Veq;
    kx2[i] = kx[i] * kx[i];
    dk[i] = k0 - std::sqrt(kx2[i] + kz * kz);
  }
}

void ShiftDistances(const AzimuthBlockPar& par, double& az, double& rg) {
  const double dr = kC / (2.0 * par.frg);
  double k0, kx, kz;
  ComputeWaveNumbers(par, k0, kx, kz);
  const int half = par.samples / 2;
  if (par.interp == 0)
    az = kx * par.Req / kz;
  else
    az = kx / kz * (half * dr * kz / k0 + par.Req);
  if (par.azshift != par.lines) az = par.Veq * par.azshift;
  rg = (k0 / kz - 1.0) * par.Req;
  if (par.rgshift != par.samples) rg = par.rgshift * kC / 2.0;
  rg += par.Req;
  if (par.interp == 0) rg += dr * half * (kz / k0 - 1.0);
}

void RngShift(const fcomplex* in, int n, double step, double k, fcomplex* out, int total,
              double offset, double divisor) {
  const float div = static_cast<float>(divisor);
  const double sk = step * k;
  const double ko = k * offset;
  for (int i = 0; i < n; ++i) {
    double sd, cd;
    wk_sincos(i * sk + ko, sd, cd);
    const float c = static_cast<float>(cd);
    const float s = static_cast<float>(sd);
    const float re = in[i].real(), im = in[i].imag();
    out[i] = fcomplex((re * c - im * s) / div, (re * s + im * c) / div);
  }
  for (int i = std::max(n, 0); i < total; ++i) out[i] = fcomplex(0.0f, 0.0f);
}

int OutImagePar(const AzimuthBlockPar& par, int& fftlen, double& spacing, int& padded,
                int& outsamples) {
  const double dr = kC / (2.0 * par.frg);
  const double sq = squintOf(par);
  const double k0 = kFourPi * par.fc / kC;
  const double kd = kTwoPi * par.dc / par.Veq;
  const double hx = kPi * par.prf / par.Veq;
  const double hk = kTwoPi * par.frg / kC;
  if (k0 - hk < kd + hx) {
    std::fprintf(stderr, "Squint angle too large: reached geometrical limit.");
    return STATUS_BAD_CONDITION;
  }
  const double kp = k0 + hk, km = k0 - hk;
  double G;
  if (par.dc > 0.0)
    G = kp * std::cos(std::asin((kd - hx) / kp)) - km * std::cos(std::asin((kd + hx) / km));
  else
    G = kp * std::cos(std::asin((kd + hx) / kp)) - km * std::cos(std::asin((kd - hx) / km));
  const double w = kTwoPi / G;
  spacing = std::max(par.scale * dr, w);
  outsamples = static_cast<int>(std::ceil(std::cos(sq) * par.samples * dr / spacing));
  fftlen = genpow(outsamples, 1);
  if (par.interp != 1) {
    padded = genpow(par.samples + 2 * static_cast<int>(std::ceil(par.samples * par.pad / 2.0)), 1);
  } else {
    const double G0 = kp * std::cos(std::asin(kd / kp)) - km * std::cos(std::asin(kd / km));
    padded = static_cast<int>(G0 / (kTwoPi / spacing) * fftlen);
  }
  return STATUS_OK;
}

int wk_column_transform(fcomplex* data, int pitch, int used, int lines, int direction) {
  if (!data || used < 1 || lines < 1 || used > pitch) return STATUS_BAD_CONDITION;
  // Sixteen columns are two cache lines of a row: a strip of a block fits
  // in the second-level cache. Each thread works through whole strips with
  // one-line transforms of its own, so no transform hands work to other
  // threads and the result does not depend on the thread count.
  constexpr int kStrip = 16;
  const int strips = (used + kStrip - 1) / kStrip;
  // Columns of a strip lie apart by the column length plus one cache line:
  // at a power-of-two length they would all fall into the same cache sets,
  // and gathering or scattering a row of the strip would evict itself.
  const std::size_t stride = static_cast<std::size_t>(lines) + 8;
  FFTPlan line;
  if (fft_makep_c(line, lines, lines, 1, 1, direction, FFT_NONE, 1) != 0) return 5;
  int status = STATUS_OK;
#pragma omp parallel
  {
    FFTBuffer strip;
    bool ok = true;
    try {
      strip.resize(static_cast<std::size_t>(kStrip) * stride);
    } catch (const std::bad_alloc&) {
      ok = false;
    }
    if (!ok) {
#pragma omp critical(wk_column_transform_status)
      status = STATUS_NO_MEMORY;
    }
    fcomplex* const t = strip.data();
#pragma omp for schedule(static)
    for (int g = 0; g < strips; ++g) {
      if (!ok) continue;
      const int c0 = g * kStrip;
      const int w = std::min(kStrip, used - c0);
      // Each row of the strip lies on its own page: the hardware does not
      // fetch ahead across pages, so the walk down the rows asks for the
      // rows a few steps ahead itself.
      constexpr int kAhead = 8;
      for (int l = 0; l < lines; ++l) {
        const fcomplex* src = data + static_cast<std::size_t>(l) * pitch + c0;
        if (l + kAhead < lines) {
          __builtin_prefetch(src + kAhead * static_cast<std::size_t>(pitch));
          __builtin_prefetch(src + kAhead * static_cast<std::size_t>(pitch) + 8);
        }
        for (int b = 0; b < w; ++b) t[b * stride + l] = src[b];
      }
      for (int b = 0; b < w; ++b) {
        fcomplex* col = t + b * stride;
        pfft_c(line, col, col);
      }
      for (int l = 0; l < lines; ++l) {
        fcomplex* dst = data + static_cast<std::size_t>(l) * pitch + c0;
        if (l + kAhead < lines) {
          __builtin_prefetch(dst + kAhead * static_cast<std::size_t>(pitch), 1);
          __builtin_prefetch(dst + kAhead * static_cast<std::size_t>(pitch) + 8, 1);
        }
        for (int b = 0; b < w; ++b) dst[b] = t[b * stride + l];
      }
    }
  }
  fft_destp_c(line);
  return status;
}

int FastWK(AzimuthBlockPar& par, const double* kx, const double* kx2, const double* dk, double az,
           double rg) {
  const int ns = par.samples, nl = par.lines;
  if (ns < 1 || nl < 1 || !par.data) {
    ORV_REPORT("Empty azimuth block", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  const double Bk = kFourPi * par.frg / kC;
  const double dkr = Bk / ns;
  const double dr = kC / (2.0 * par.frg);
  double k0, kxc, kzc;
  ComputeWaveNumbers(par, k0, kxc, kzc);

  std::vector<double> table(ns), rwin;
  try {
    for (int i = 0; i < ns; ++i)
      table[(ns / 2 + i) % ns] = i * dkr + k0 - std::floor(ns / 2) * dkr;
    const WKWeighting wt(par);
    const bool A = wt.active;
    const float S = par.conj ? static_cast<float>(static_cast<double>(nl) * ns) : 1.0f;
    if (par.rgw != 0.0) {
      rwin.resize(ns);
      for (int i = 0; i < ns; ++i) rwin[i] = wt.rangeTerm(table[i]);
    }

    fcomplex* data = par.data;
    const int dir = par.conj ? FFT_BACKWARD_NORMALISED : FFT_FORWARD;
    FFTPlan fwd, rowInv;
    int st = fft_makep_c(fwd, ns, ns, nl, nl, dir, FFT_NONE, 1);
    if (st == 0) st = fft_makep_c(rowInv, ns, ns, nl, nl, FFT_BACKWARD_NORMALISED, FFT_NONE, 1);
    if (st == 0) {
      pfft_c(fwd, data, data);
      st = wk_column_transform(data, ns, ns, nl, dir);
    }
    if (st != 0) {
      ORV_REPORT("Cannot make the transform plans of the block", REPORT_ERROR);
      return STATUS_BAD_CONDITION;
    }

    // Reference function, windows and whitening; energy sums per row so that
    // the parallel run adds them in the serial order.
    const double inBand = (par.bw / par.frg) * Bk / 2.0;
    std::vector<double> rowN(nl, 0.0), rowD(nl, 0.0);
    const int conj = par.conj;
    const double Req = par.Req;
    // Wavenumbers in ascending order (transform position (ns/2 + i) % ns) for
    // the row weighting.
    std::vector<double> ascending(ns);
    for (int i = 0; i < ns; ++i) ascending[i] = table[(ns / 2 + i) % ns];
#pragma omp parallel
    {
      std::vector<double> termAsc(A ? ns : 0), PAsc(A ? ns : 0);
#pragma omp for schedule(static)
      for (int j = 0; j < nl; ++j) {
        fcomplex* row = data + static_cast<std::size_t>(j) * ns;
        double N = 0.0, D = 0.0;
        if (A) wt.azimuthRow(ascending.data(), ns, kx[j], termAsc.data(), PAsc.data());
        for (int i = 0; i < ns; ++i) {
          fcomplex v = row[i];
          if (conj) v = std::conj(v);
          const double k = table[i];
          // The azimuth shift turns with the absolute wavenumber kx: a
          // shift against the centroid's kx would leave the phase -kxc az
          // on every target.
          const double phase = (std::sqrt(k * k - kx2[j]) - kzc) * Req - (k - k0) * rg + kx[j] * az;
          v = wk_rotate(v, phase);
          float W = 1.0f;
          if (A) {
            const int a = (i + ns - ns / 2) % ns;  // ascending position of i
            const double P = PAsc[a];
            const double aw = termAsc[a];
            const double rw = rwin.empty() ? 1.0 : rwin[i];
            W = static_cast<float>(aw * rw);
            if (std::fabs(k - k0) < inBand) {
              D += P;
              N += P * W * W;
            }
          }
          const float ws = W * S;
          row[i] = fcomplex(v.real() * ws, v.imag() * ws);
        }
        rowN[j] = N;
        rowD[j] = D;
      }
    }
    pfft_c(rowInv, data, data);
    double N = 0.0, D = 0.0;
    for (int j = 0; j < nl; ++j) {
      N += rowN[j];
      D += rowD[j];
    }
    const double g = (A && D > 0.0) ? std::sqrt(N / D) : 1.0;

    const double off = -(ns / 2) * dr * std::cos(wt.sq);
#pragma omp parallel for schedule(static)
    for (int j = 0; j < nl; ++j) {
      fcomplex* row = data + static_cast<std::size_t>(j) * ns;
      RngShift(row, ns, dr, dk[j], row, ns, off, g);
    }
    if (wk_column_transform(data, ns, ns, nl, FFT_BACKWARD_NORMALISED) != 0) {
      ORV_REPORT("Cannot make the transform plans of the block", REPORT_ERROR);
      return STATUS_BAD_CONDITION;
    }
    if (par.final == 1) {
#pragma omp parallel for schedule(static)
      for (int j = 0; j < nl; ++j) {
        fcomplex* row = data + static_cast<std::size_t>(j) * ns;
        RngShift(row, ns, dr, kzc - k0, row, ns, 0.0, 1.0);
      }
    }
    fft_destp_c(fwd);
    fft_destp_c(rowInv);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory in the omega-K kernel", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  return STATUS_OK;
}

int focazwk(AzimuthBlockPar& par, AzimuthBlockOut& out) {
  if (par.reestimate) {
    // Per-block centroid re-estimation is not part of this library; the
    // block keeps the centroid of the model.
    ORV_REPORT("Centroid re-estimation per block not available: model centroid kept",
               REPORT_WARNING);
  }
  int st = MyComputeEqPar(par);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  int fftlen = 0, padded = 0, outsamples = 0;
  double spacing = 0.0;
  st = OutImagePar(par, fftlen, spacing, padded, outsamples);
  if (st != 0) return st;

  std::vector<double> kx, kx2, dk;
  try {
    kx.resize(par.lines);
    kx2.resize(par.lines);
    dk.resize(par.lines);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory for the azimuth wavenumber grid", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  AzimuthGrid(par, kx.data(), kx2.data(), dk.data());
  double az = 0.0, rg = 0.0;
  ShiftDistances(par, az, rg);

  out.lines = par.lines;
  out.samples = par.samples;
  out.spacing = kC / (2.0 * par.frg);
  if (par.scale != 1.0 && par.interp > 0) {
    out.samples = outsamples;
    out.spacing = spacing;
  }
  out.dc = par.dc;
  out.aztime = az / par.Veq;
  out.rgtime = 2.0 * rg / kC;

  if (par.interp == 0) {
    st = FastWK(par, kx.data(), kx2.data(), dk.data(), az, rg);
  } else {
    if (par.interp == 1)
      st = ChirpInterpWK(par, padded, fftlen, outsamples, kx.data(), kx2.data(), dk.data(),
                         spacing, az, rg);
    else
      st = LSInterpWK(par, padded, fftlen, outsamples, kx.data(), kx2.data(), dk.data(), spacing,
                      az, rg);
  }
  if (st != 0) ORV_REPORT_CALLED_ERROR();
  return st;
}

namespace {

// Depth of the range migration at the centroid v = lambda dc / 2 of the
// target at equivalent range Rq, m: that of the hyperbola of its own rate
// and of the rate's slope in range, less that of the sub-block's hyperbola
// (speed Veq, Rq growing one to one with the range, the chord of the rate
// polynomial across the sub-block). The two agree where 1 / rate is linear
// in range; an orbit's effective speed falls across the swath and the rate
// is a cubic, and in the middle of a sub-block three PRFs from zero Doppler
// they part by a quarter of a millimetre, 3 degrees of phase.
double tangentDepthOffset(const AzimuthBlockPar& par, double Rq, double v, double cs) {
  const double lambda = kC / par.fc;
  const double nearRq = par.Req - (par.interp == 0 ? cs * (par.samples / 2) * kC / (2.0 * par.frg) : 0.0);
  const double x = par.t0 - par.trg0 + (Rq - nearRq) / cs / kHalfC;
  const double f = par.fr0 + x * (par.fr1 + x * (par.fr2 + x * par.fr3));
  const double df = (par.fr1 + x * (2.0 * par.fr2 + x * 3.0 * par.fr3)) / kHalfC;  // per metre
  if (!(f < 0.0 && df > 0.0)) return 0.0;
  const double Rc = -f / df;
  const double W = lambda * f * f / (2.0 * df);
  return Rc * (1.0 - std::sqrt(W / (W + v * v))) - Rq * (1.0 / cs - 1.0);
}

// The kernels reference a sub-block to its equivalent geometry: a target
// that lies x metres beyond the first output sample of the sub-block sits at
// the equivalent range Rq = Req + x, and the reference function leaves it
// at the phase -kz Rq - k0 (R0 - Rq) instead of -k0 R0, kz = sqrt(k0^2 -
// kx^2) with kx = 2 pi dcref / Veq. Turning the output sample at range R by
// (kz - k0) (Req + R - Rw0), Rw0 the range of the sub-block's first output
// sample, leaves every target at -k0 R0 whatever the centroid. (Req and Veq
// describe the range curvature, not the slant range and the platform speed,
// so neither the scene's nor the block's centroid reference would do.) The
// reference function is the stationary-phase spectrum of the azimuth chirp,
// which lacks the -pi/4 that the transform of a down-chirp carries; it is
// put back here too (with the opposite sign for conjugated processing),
// and `extra`, a phase of the whole sub-block. So is k0 times the depth
// that the target's range history has beyond the sub-block's hyperbola
// (tangentDepthOffset).
void residualPhasors(const AzimuthBlockPar& par, double rw0, double r0, double dr, int n, double extra,
                     std::vector<fcomplex>& turn) {
  double k0, kx, kz;
  ComputeWaveNumbers(par, k0, kx, kz);
  const double quarter = (par.conj ? -kPi : kPi) / 4.0 + extra;
  const double v = par.dc * kC / par.fc / 2.0;
  const double cs = std::sqrt(1.0 - (v / par.Veq) * (v / par.Veq));
  turn.resize(n);
  for (int i = 0; i < n; ++i) {
    const double Rq = par.Req + r0 + i * dr - rw0;
    double sd, cd;
    wk_sincos((kz - k0) * Rq + k0 * tangentDepthOffset(par, Rq, v, cs) + quarter, sd, cd);
    turn[i] = fcomplex(static_cast<float>(cd), static_cast<float>(sd));
  }
}

}  // namespace

int multirg(AzimuthBlockPar& par, AzimuthBlockOut& out, int subSamples, int overlap,
            const double poly[5], double tref, int block, int blocks, FFTBuffer* scratch,
            const BlockStrip* strip) {
  const int S = par.samples;
  const int s = subSamples;
  const int o = overlap;
  const int nl = par.lines;
  const double t0keep = par.t0;
  const double fr0keep = par.fr0, fr1keep = par.fr1;
  const double azshiftKeep = par.azshift;
  fcomplex* const blockData = par.data;
  auto dcAt = [&](double x) {
    return poly[0] + poly[1] * x + poly[2] * x * x + poly[3] * x * x * x +
           poly[4] * x * x * x * x;
  };
  auto restore = [&]() {
    par.t0 = t0keep;
    par.fr0 = fr0keep;
    par.fr1 = fr1keep;
    par.azshift = azshiftKeep;
    par.data = blockData;
    par.samples = S;
  };

  if (s - o <= 0) {
    ORV_REPORT("Range sub-block not longer than its overlap", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  const double dr = kC / (2.0 * par.frg);
  par.dc = dcAt((S / par.frg) / 2.0 + par.t0 - tref);
  int st = MyComputeEqPar(par);
  if (st != 0) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  const double squint0 = std::asin(kC / par.fc * par.dc / 2.0 / par.Veq);
  double k0, kxc, kzc;
  ComputeWaveNumbers(par, k0, kxc, kzc);
  // Slant range of output sample 0 of the block: the product's first
  // sample when the caller gives it, else that of input sample o / 2.
  const double range0 = par.range0 != 0.0 ? par.range0 : (o / 2) * dr + par.t0 * kC / 2.0;

  const int nsub = (S - o + (s - o) - 1) / (s - o);
  const std::size_t workSize = static_cast<std::size_t>(nl) * s;
  if (workSize == 0 || nsub < 1) {
    ORV_REPORT("cannot allocate memory", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  FFTBuffer own;
  FFTBuffer& work = scratch ? *scratch : own;
  try {
    if (work.size() < workSize) work.resize(workSize);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("cannot allocate memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  par.data = work.data();
  par.samples = s;

  double E = 0.0, H = 0.0, r = 1.0, lagPhase = 0.0;
  std::vector<fcomplex> turn;
  for (int b = 0; b < nsub; ++b) {
    const int f = b * (s - o);
    const int ncopy = std::min(s, S - f);
    par.t0 = t0keep + f / par.frg;
    par.dc = dcAt((s / par.frg) / 2.0 + par.t0 - tref);
    par.fr0 = fr0keep;
    par.fr1 = fr1keep;
    const WKRateDrift drift = wk_rate_drift(par);
    // The sub-block's columns of the block: row j at cols + j * pitch.
    fcomplex* cols = blockData + f;
    int pitch = S;
    if (strip) {
      st = strip->columns(f, ncopy, cols);
      if (st != 0) break;
      pitch = strip->pitch;
    }
    std::vector<double> centroids;
    if (drift.active) {
      // Resampled to the speed of the block's centre row.
      try {
        centroids.resize(ncopy);
        for (int i = 0; i < ncopy; ++i) centroids[i] = dcAt(par.t0 + i / par.frg - tref);
        wk_resample_rows(cols, pitch, work.data(), s, nl, ncopy, par.prf, -drift.alpha, 0.0,
                         0.0, centroids.data());
      } catch (const std::bad_alloc&) {
        st = STATUS_NO_MEMORY;
        break;
      }
      for (int j = 0; j < nl; ++j) {
        fcomplex* dst = work.data() + static_cast<std::size_t>(j) * s;
        std::fill(dst + ncopy, dst + s, fcomplex(0.0f, 0.0f));
      }
    } else {
#pragma omp parallel for schedule(static)
      for (int j = 0; j < nl; ++j) {
        fcomplex* dst = work.data() + static_cast<std::size_t>(j) * s;
        std::memcpy(dst, cols + static_cast<std::size_t>(j) * pitch, sizeof(fcomplex) * ncopy);
        std::fill(dst + ncopy, dst + s, fcomplex(0.0f, 0.0f));
      }
    }

    // Running range shift: keeps the sub-blocks on one range grid when the
    // reference wavenumber changes from one sub-block to the next.
    if (b == 0 || par.interp == 0) {
      st = MyComputeEqPar(par);
      if (st != 0) break;
      const double kx = kTwoPi * par.dcref / par.Veq;
      const double kz = std::sqrt(k0 * k0 - kx * kx);
      par.rgshift += (std::cos(squint0) - kz / k0) * (o / 2) / par.frg;
      E = 2.0 * (k0 / kz - 1.0) * par.Req / kC - par.rgshift;
      H = 0.0;
      r = kz / k0;
    } else {
      H += ((1.0 - r) * s - (1.0 - r / 2.0) * o) / par.frg;
      st = MyComputeEqPar(par);
      if (st != 0) break;
      const double kx = kTwoPi * par.dcref / par.Veq;
      const double kz = std::sqrt(k0 * k0 - kx * kx);
      r = kz / k0;
      H += r * (o / 2) / par.frg;
      par.rgshift = 2.0 * (k0 / kz - 1.0) * par.Req / kC - H - E;
      // The running shift H is applied before the Stolt mapping, where a
      // range shift is not one of the focused image: moving the echoes by
      // lag = H c / 2 in range leaves the targets lag sin(squint) / Veq
      // seconds late and turned by (k0 - kz) lag (at three PRFs 1.5 m per
      // 960 samples, 0.007 line and -4 degrees per sub-block). The azimuth
      // shift and the sub-block's phase take both back.
      const double lag = H * kC / 2.0;
      par.azshift = azshiftKeep - lag * (kx / k0) / par.Veq;
      lagPhase = (k0 - kz) * lag;
    }

    st = focazwk(par, out);
    if (st != 0) break;
    const int ncopyBack = std::min(s - o, S - o - f);
    if (ncopyBack > 0) {
      // Residual phase of the targets of this sub-block, taken out as it is
      // copied back (see residualPhasors). Without Stolt mapping the
      // equivalent range refers to the middle of the sub-block.
      try {
        const double firstOut = range0 + (f - o / 2) * out.spacing;
        const double rw0 = par.interp == 0 ? firstOut + (s / 2) * out.spacing : firstOut;
        residualPhasors(par, rw0, range0 + f * out.spacing, out.spacing, ncopyBack, lagPhase, turn);
      } catch (const std::bad_alloc&) {
        st = STATUS_NO_MEMORY;
        break;
      }
      if (drift.active) {
        // Targets back at their zero-Doppler times (see wk_resample_rows).
        wk_resample_rows(work.data() + o / 2, s, cols, pitch, nl, ncopyBack, par.prf,
                         drift.alpha, out.aztime, drift.beamLead, centroids.data() + o / 2);
#pragma omp parallel for schedule(static)
        for (int j = 0; j < nl; ++j) {
          fcomplex* dst = cols + static_cast<std::size_t>(j) * pitch;
          for (int i = 0; i < ncopyBack; ++i) dst[i] *= turn[i];
        }
      } else {
#pragma omp parallel for schedule(static)
        for (int j = 0; j < nl; ++j) {
          const fcomplex* src = work.data() + static_cast<std::size_t>(j) * s + o / 2;
          fcomplex* dst = cols + static_cast<std::size_t>(j) * pitch;
          for (int i = 0; i < ncopyBack; ++i) dst[i] = src[i] * turn[i];
        }
      }
    }
    if (par.verbose)
      waitbar_update(0, static_cast<float>((static_cast<double>(block) * nsub + b) /
                                           (static_cast<double>(blocks) * nsub) * 100.0));
  }
  if (st != 0) {
    restore();
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  restore();
  return STATUS_OK;
}
