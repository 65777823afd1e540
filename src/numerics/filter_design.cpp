#include "numerics/filter_design.h"

#include <algorithm>
#include <cmath>
#include <complex>
#include <new>
#include <vector>

#include "base/constants.h"
#include "base/status.h"
#include "diag/report.h"
#include "numerics/matrix_kernels.h"

namespace {

constexpr double kPi = consts::kPi;
constexpr int kGridDensity = 128;  // fine enough for the peaks to sit within 0.01 % of the ripple
constexpr int kMaxExchanges = 40;

// Cosine polynomial P(x), x = cos(2 pi f), through the nodes x[i] with values
// c[i], in barycentric form with weights ad[i].
double barycentric(double xv, const std::vector<double>& x, const std::vector<double>& ad,
                   const std::vector<double>& c) {
  double num = 0.0, den = 0.0;
  for (std::size_t i = 0; i < x.size(); ++i) {
    const double d = xv - x[i];
    if (d == 0.0) return c[i];
    const double t = ad[i] / d;
    num += t * c[i];
    den += t;
  }
  return num / den;
}

// The weighted error on the grid and its extremal set. Returns the local
// extrema of E, alternating in sign, reduced to `want` points.
std::vector<int> Search(const std::vector<double>& E, int want) {
  const int g = static_cast<int>(E.size());
  std::vector<int> ext;
  for (int k = 0; k < g; ++k) {
    const double e = E[k];
    const double prev = (k > 0) ? E[k - 1] : (e > 0 ? -HUGE_VAL : HUGE_VAL);
    const double next = (k < g - 1) ? E[k + 1] : (e > 0 ? -HUGE_VAL : HUGE_VAL);
    if ((e > 0.0 && e >= prev && e > next) || (e < 0.0 && e <= prev && e < next) ||
        (e > 0.0 && e > prev && e >= next) || (e < 0.0 && e < prev && e <= next))
      ext.push_back(k);
  }
  // Alternation: of consecutive extrema with the same sign keep the larger.
  auto merge = [&]() {
    std::vector<int> out;
    for (int k : ext) {
      if (!out.empty() && (E[out.back()] > 0) == (E[k] > 0)) {
        if (std::fabs(E[k]) > std::fabs(E[out.back()])) out.back() = k;
      } else {
        out.push_back(k);
      }
    }
    ext.swap(out);
  };
  merge();
  while (static_cast<int>(ext.size()) > want) {
    if (static_cast<int>(ext.size()) == want + 1) {
      // Drop the smaller of the two ends.
      if (std::fabs(E[ext.front()]) < std::fabs(E[ext.back()]))
        ext.erase(ext.begin());
      else
        ext.pop_back();
    } else {
      auto smallest = std::min_element(ext.begin(), ext.end(), [&](int a, int b) {
        return std::fabs(E[a]) < std::fabs(E[b]);
      });
      ext.erase(smallest);
      merge();
    }
  }
  return ext;
}

double sinc(double x) {
  if (x == 0.0) return 1.0;
  const double px = kPi * x;
  return std::sin(px) / px;
}

}  // namespace

int remez_(double* h, int n, int nbands, const double* bands, const double* desired,
           const double* weights, int type) {
  if (n < 3 || nbands < 1 || type < REMEZ_BANDPASS || type > REMEZ_HILBERT) {
    ORV_REPORT("remez: bad filter length, band count or filter type", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  for (int j = 0; j < 2 * nbands; ++j) {
    if (bands[j] < 0.0 || bands[j] > 0.5 || (j > 0 && bands[j] < bands[j - 1])) {
      ORV_REPORT("remez: band edges must increase within 0 .. 0.5", REPORT_ERROR);
      return STATUS_BAD_CONDITION;
    }
  }
  for (int j = 0; j < nbands; ++j)
    if (!(weights[j] > 0.0)) {
      ORV_REPORT("remez: band weights must be positive", REPORT_ERROR);
      return STATUS_BAD_CONDITION;
    }
  try {
    const bool symmetric = (type == REMEZ_BANDPASS);
    const bool odd = (n % 2) == 1;
    // Number of cosine terms and the fixed factor Q(f) of each case.
    const int r = symmetric ? (odd ? (n + 1) / 2 : n / 2) : (odd ? (n - 1) / 2 : n / 2);
    auto Q = [&](double f) {
      if (symmetric) return odd ? 1.0 : std::cos(kPi * f);
      return odd ? std::sin(2.0 * kPi * f) : std::sin(kPi * f);
    };
    const bool zeroAtHalf = (symmetric && !odd) || (!symmetric && odd);

    // Dense grid over the bands.
    const double delf = 0.5 / (kGridDensity * r);
    std::vector<double> gf, gd, gw;
    for (int j = 0; j < nbands; ++j) {
      double lo = bands[2 * j], hi = bands[2 * j + 1];
      if (!symmetric && lo < delf) lo = delf;
      if (zeroAtHalf && hi > 0.5 - delf) hi = 0.5 - delf;
      if (hi < lo) continue;
      const int count = std::max(1, static_cast<int>(std::ceil((hi - lo) / delf)));
      for (int k = 0; k <= count; ++k) {
        const double f = (k == count) ? hi : lo + k * delf;
        if (k > 0 && f <= gf.back()) continue;
        double d = desired[j], w = weights[j];
        if (type == REMEZ_DIFFERENTIATOR) {
          d = desired[j] * f;
          if (desired[j] > 1e-4) w = weights[j] / f;
        }
        const double q = Q(f);
        gf.push_back(f);
        gd.push_back(d / q);
        gw.push_back(w * q);
      }
    }
    const int g = static_cast<int>(gf.size());
    if (g < r + 1) {
      ORV_REPORT("remez: bands too narrow for the filter length", REPORT_ERROR);
      return STATUS_BAD_CONDITION;
    }

    std::vector<int> ext(r + 1);
    for (int i = 0; i <= r; ++i) ext[i] = static_cast<int>((static_cast<long>(g - 1) * i) / r);
    std::vector<double> x(r + 1), ad(r + 1), c(r + 1), E(g);
    bool converged = false;
    for (int iter = 0; iter < kMaxExchanges; ++iter) {
      for (int i = 0; i <= r; ++i) x[i] = std::cos(2.0 * kPi * gf[ext[i]]);
      for (int i = 0; i <= r; ++i) {
        double p = 1.0;
        for (int j = 0; j <= r; ++j)
          if (j != i) p *= 2.0 * (x[i] - x[j]);
        ad[i] = 1.0 / p;
      }
      double num = 0.0, den = 0.0, sign = 1.0;
      for (int i = 0; i <= r; ++i) {
        num += ad[i] * gd[ext[i]];
        den += sign * ad[i] / gw[ext[i]];
        sign = -sign;
      }
      const double delta = num / den;
      sign = 1.0;
      for (int i = 0; i <= r; ++i) {
        c[i] = gd[ext[i]] - sign * delta / gw[ext[i]];
        sign = -sign;
      }
      double emax = 0.0;
      for (int k = 0; k < g; ++k) {
        E[k] = gw[k] * (gd[k] - barycentric(std::cos(2.0 * kPi * gf[k]), x, ad, c));
        emax = std::max(emax, std::fabs(E[k]));
      }
      if (emax - std::fabs(delta) <= 1e-9 * emax) {
        converged = true;
        break;
      }
      std::vector<int> next = Search(E, r + 1);
      if (static_cast<int>(next.size()) < r + 1 || next == ext) {
        converged = true;  // no better alternation set: the current one is final
        break;
      }
      ext.swap(next);
    }
    if (!converged) ORV_REPORT("remez: exchange did not converge, using the last design", REPORT_WARNING);

    // Taps from n samples of the amplitude response.
    const double M = (n - 1) / 2.0;
    std::vector<double> amp(n);
    for (int k = 0; k < n; ++k) {
      const double f = static_cast<double>(k) / n;
      amp[k] = Q(f) * barycentric(std::cos(2.0 * kPi * f), x, ad, c);
    }
    for (int m = 0; m < n; ++m) {
      double s = 0.0;
      for (int k = 0; k < n; ++k) {
        const double arg = 2.0 * kPi * (static_cast<double>(k) / n) * (m - M);
        s += symmetric ? amp[k] * std::cos(arg) : -amp[k] * std::sin(arg);
      }
      h[m] = s / n;
    }
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  return STATUS_OK;
}

int remez(fcomplex* h, int n, int nbands, const double* bands, const double* desired,
          const double* weights) {
  try {
    std::vector<double> taps(std::max(n, 0));
    const int status = remez_(taps.data(), n, nbands, bands, desired, weights, REMEZ_BANDPASS);
    if (status != STATUS_OK) {
      ORV_REPORT_CALLED_ERROR();
      return status;
    }
    for (int k = 0; k < n; ++k) h[k] = fcomplex(static_cast<float>(taps[k]), 0.0f);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  return STATUS_OK;
}

namespace {

// Least-squares kernels for the autocorrelation sinc(B d), optionally turned
// into the one-sided band by the phase exp(-j pi B d).
int makeKernels(fcomplex* h, int n, int nfrac, double bandwidth, bool oneSided) {
  if (n < 1 || nfrac < 1 || !(bandwidth > 0.0) || bandwidth > 1.0) {
    ORV_REPORT("MakeGLS: bad kernel length, table size or bandwidth", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  try {
    std::vector<double> S(static_cast<std::size_t>(n) * n), Si(S.size()), s(n), v(n);
    for (int k = 0; k < n; ++k)
      for (int l = 0; l < n; ++l) S[k * n + l] = sinc(bandwidth * (k - l));
    int status = MatInv(S.data(), Si.data(), n);
    if (status != STATUS_OK) {
      ORV_REPORT_CALLED_ERROR();
      return status;
    }
    const double centre = (n - 1) / 2.0;
    for (int row = 0; row < nfrac; ++row) {
      const double f = (nfrac > 1) ? static_cast<double>(row) / (nfrac - 1) - 0.5 : 0.0;
      const double t = centre + f;
      for (int m = 0; m < n; ++m) s[m] = sinc(bandwidth * (t - m));
      status = Mmolt(Si.data(), n, n, s.data(), n, 1, v.data());
      if (status != STATUS_OK) {
        ORV_REPORT_CALLED_ERROR();
        return status;
      }
      for (int m = 0; m < n; ++m) {
        std::complex<double> w(v[m], 0.0);
        if (oneSided) w *= std::polar(1.0, -kPi * bandwidth * (t - m));
        h[static_cast<std::size_t>(row) * n + m] =
            fcomplex(static_cast<float>(w.real()), static_cast<float>(w.imag()));
      }
    }
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  return STATUS_OK;
}

// Row and first input sample of the kernel that interpolates at position p.
void kernelFor(double p, int n, int nfrac, long* first, int* row) {
  const double centre = (n - 1) / 2.0;
  const double base = std::round(p - centre);
  const double f = p - centre - base;  // -0.5 .. 0.5
  *first = static_cast<long>(base);
  *row = (nfrac > 1) ? static_cast<int>(std::lround((f + 0.5) * (nfrac - 1))) : 0;
}

}  // namespace

int MakeGLS(fcomplex* h, int n, int nfrac, double bandwidth) {
  const int status = makeKernels(h, n, nfrac, bandwidth, true);
  if (status != STATUS_OK) ORV_REPORT_CALLED_ERROR();
  return status;
}

int MakeGLSlowpass(fcomplex* h, int n, int nfrac, double bandwidth) {
  const int status = makeKernels(h, n, nfrac, bandwidth, false);
  if (status != STATUS_OK) ORV_REPORT_CALLED_ERROR();
  return status;
}

void glsF(const float* in, int nIn, const double* pos, float* out, int nOut, const fcomplex* table,
          int n, int nfrac) {
  for (int i = 0; i < nOut; ++i) {
    long first;
    int row;
    kernelFor(pos[i], n, nfrac, &first, &row);
    const fcomplex* k = table + static_cast<std::size_t>(row) * n;
    double s = 0.0;
    for (int m = 0; m < n; ++m) {
      const long j = first + m;
      if (j >= 0 && j < nIn) s += static_cast<double>(k[m].real()) * in[j];
    }
    out[i] = static_cast<float>(s);
  }
}

void glsFcomplex(const fcomplex* in, int nIn, const double* pos, fcomplex* out, int nOut,
                 const fcomplex* table, int n, int nfrac) {
  for (int i = 0; i < nOut; ++i) {
    long first;
    int row;
    kernelFor(pos[i], n, nfrac, &first, &row);
    const fcomplex* k = table + static_cast<std::size_t>(row) * n;
    std::complex<double> s(0.0, 0.0);
    for (int m = 0; m < n; ++m) {
      const long j = first + m;
      if (j >= 0 && j < nIn)
        s += std::complex<double>(k[m].real(), k[m].imag()) *
             std::complex<double>(in[j].real(), in[j].imag());
    }
    out[i] = fcomplex(static_cast<float>(s.real()), static_cast<float>(s.imag()));
  }
}
