#include "core/stolt_interpolation.h"

#include <algorithm>
#include <cmath>
#include <complex>
#include <cstddef>
#include <cstring>
#include <memory>
#include <new>
#include <string>
#include <vector>

#ifdef _OPENMP
#include <omp.h>
#endif

#include "base/constants.h"
#include "base/status.h"
#include "core/fft.h"
#include "diag/report.h"
#include "numerics/filter_design.h"
#include "numerics/interleaved_sums.h"

namespace {

constexpr double kC = consts::kSpeedOfLight;
constexpr double kPi = consts::kPi;
constexpr double kTwoPi = 2.0 * consts::kPi;
constexpr double kFourPi = 4.0 * consts::kPi;
// Fractional positions of the least-squares filter table: (r - 50) / 100.
constexpr int kFractions = 101;

int threadCount() {
#ifdef _OPENMP
  return omp_get_max_threads();
#else
  return 1;
#endif
}

int threadIndex() {
#ifdef _OPENMP
  return omp_get_thread_num();
#else
  return 0;
#endif
}

// x * exp(j phase), the rotation narrowed to float.
inline fcomplex rotate(fcomplex x, double phase) { return wk_rotate(x, phase); }

// exp(j phase) narrowed to float.
inline fcomplex unitPhasor(double phase) {
  double s, c;
  wk_sincos(phase, s, c);
  return fcomplex(static_cast<float>(c), static_cast<float>(s));
}

// Plain complex product (no special cases for infinities).
inline fcomplex mul(fcomplex a, fcomplex b) {
  return fcomplex(a.real() * b.real() - a.imag() * b.imag(),
                  a.real() * b.imag() + a.imag() * b.real());
}

// std::round for |x| below 2^62 without the library call, and without
// branches: the fractions of the Stolt positions are random, and a branch on
// them would be mispredicted half of the time.
inline double roundHalfAway(double x) {
  const double t = static_cast<double>(static_cast<long long>(x));
  const double f = x - t;
  return t + static_cast<double>(f >= 0.5) - static_cast<double>(f <= -0.5);
}

inline fcomplex scaled(fcomplex x, float f) { return fcomplex(x.real() * f, x.imag() * f); }

// Eight floats: four complex samples.
typedef float V8 __attribute__((vector_size(32)));
struct Lanes {
  V8 v;
};

// The least-squares filter table laid out for four taps per vector: for
// taps 4p .. 4p+3 of a row, (re, re, re', re', ...) and (im, -im, im', -im',
// ...); rows whose tap count is not a multiple of four end with zero taps.
// Multiplied lane by lane with four interleaved complex samples, the first
// gives (h.re s.re, h.re s.im) and the second (h.im s.re, -h.im s.im) per
// tap: the sums of the lanes in the right places make the complex product,
// so four taps cost two vector products (two fused products and sums where
// the processor has them).
struct QuadTaps {
  int quads = 0;
  std::vector<Lanes> re, im;
  void make(const std::vector<fcomplex>& table, int rows, int taps) {
    quads = (taps + 3) / 4;
    const V8 zero = {0.0f, 0.0f, 0.0f, 0.0f, 0.0f, 0.0f, 0.0f, 0.0f};
    re.assign(static_cast<std::size_t>(rows) * quads, Lanes{zero});
    im.assign(re.size(), Lanes{zero});
    for (int r = 0; r < rows; ++r)
      for (int m = 0; m < taps; ++m) {
        const fcomplex h = table[static_cast<std::size_t>(r) * taps + m];
        V8& a = re[static_cast<std::size_t>(r) * quads + m / 4].v;
        V8& b = im[static_cast<std::size_t>(r) * quads + m / 4].v;
        const int lane = 2 * (m % 4);
        a[lane] = a[lane + 1] = h.real();
        b[lane] = h.imag();
        b[lane + 1] = -h.imag();
      }
  }
  // Samples each row of taps reads: a whole number of quads.
  int span() const { return 4 * quads; }
  // sum over the taps of row r of h[m] s[m]; reads span() samples of s.
  __attribute__((always_inline)) fcomplex apply(int r, const fcomplex* s) const {
    const Lanes* a = re.data() + static_cast<std::size_t>(r) * quads;
    const Lanes* b = im.data() + static_cast<std::size_t>(r) * quads;
    V8 p = {0.0f, 0.0f, 0.0f, 0.0f, 0.0f, 0.0f, 0.0f, 0.0f}, q = p;
    for (int m = 0; m < quads; ++m) {
      V8 x;
      std::memcpy(&x, s + 4 * m, sizeof x);
      p += a[m].v * x;
      q += b[m].v * x;
    }
    return fcomplex(((p[0] + p[2]) + (p[4] + p[6])) + ((q[1] + q[3]) + (q[5] + q[7])),
                    ((p[1] + p[3]) + (p[5] + p[7])) + ((q[0] + q[2]) + (q[4] + q[6])));
  }
};

// Whether this processor runs the wide (AVX2 and FMA) form of the row
// kernels.
bool wideRows() {
  static const bool wide = __builtin_cpu_supports("avx2") && __builtin_cpu_supports("fma");
  return wide;
}

// What both kernels derive from the block record before the row loop.
struct StoltGrid {
  double sq = 0.0;   // squint of the centroid
  double dr = 0.0;   // input slant spacing, m
  double Bk = 0.0;   // range wavenumber band
  double k0 = 0.0, kxc = 0.0, kzc = 0.0;
  double dkz = 0.0, kzs = 0.0, kze = 0.0;
  std::vector<int> idx;     // transform position of output wavenumber q
  std::vector<double> kz;   // output wavenumber grid, M values
  fcomplex* result = nullptr;
  int pitch = 0;            // row pitch of the result
  int dir = FFT_FORWARD;    // transform direction code of the forward passes
  double inBand = 0.0;      // half-width of the band of the gain sums

  StoltGrid(const AzimuthBlockPar& par, int M, int n, double spacing) {
    sq = std::asin(kC / par.fc * par.dc / 2.0 / par.Veq);
    dr = kC / (2.0 * par.frg);
    Bk = kFourPi * par.frg / kC;
    ComputeWaveNumbers(par, k0, kxc, kzc);
    idx.resize(M);
    for (int i = 0; i < M; ++i) idx[i] = (M / 2 + i) % M;
    dkz = (kTwoPi / spacing) / M;
    kzs = std::sqrt(k0 * k0 - kxc * kxc) - std::floor(M / 2) * dkz;
    kze = kzs + (M - 1) * dkz;
    kz.resize(M);
    for (int q = 0; q < M; ++q) kz[q] = kzs + q * dkz;
    if (par.scale == 1.0) {
      result = par.data;
      pitch = par.samples;
    } else {
      result = par.out;
      pitch = n;
    }
    dir = par.conj ? FFT_BACKWARD_NORMALISED : FFT_FORWARD;
    inBand = (par.bw / par.frg) * Bk / 2.0;
  }

  // First and last output wavenumber index inside [lo, hi] (ihi < ilo: none).
  void usable(double lo, double hi, int& ilo, int& ihi) const {
    if (std::isnan(lo) || std::isnan(hi)) {  // row beyond the geometric limit
      ilo = 0;
      ihi = -1;
      return;
    }
    lo = std::max(lo, kzs);
    hi = std::min(hi, kze);
    ilo = static_cast<int>(std::ceil((lo - kzs) / dkz));
    ihi = static_cast<int>(std::floor((hi - kzs) / dkz)) - 1;
    ilo = std::max(ilo, 0);
    ihi = std::min(ihi, static_cast<int>(kz.size()) - 1);
  }

  // n samples of the inverse-transformed line into row j of the result.
  void store(int j, const fcomplex* line, int n) const {
    fcomplex* row = result + static_cast<std::size_t>(j) * pitch;
    std::copy(line, line + n, row);
    std::fill(row + n, row + pitch, fcomplex(0.0f, 0.0f));
  }
};

// Chirp-z zoom of rows of M samples onto K output points,
//   X[k] = sum_n x[n] exp(j n (a k - b)),
// with the kernel spectrum and the post-chirp made once for a block (a is
// fixed there); only the pre-chirp depends on the row through b. Work
// buffers come from the caller so that every thread transforms buffers of
// the same alignment.
class Zoom {
 public:
  int make(int M, int K, double a) {
    M_ = M;
    K_ = K;
    a_ = a;
    L_ = genpow(M + K - 1, 1);
    if (fft_makep_c(fwd_, L_, L_, 1, 1, FFT_FORWARD, FFT_NONE, 1) != 0 ||
        fft_makep_c(inv_, L_, L_, 1, 1, FFT_BACKWARD_NORMALISED, FFT_NONE, 1) != 0)
      return STATUS_BAD_CONDITION;
    kernel_.assign(L_, fcomplex(0.0f, 0.0f));
    post_.resize(K);
    for (int k = 0; k < K; ++k) post_[k] = unit(ph(k));
    for (int m = 0; m <= M + K - 2; ++m) kernel_[m] = unit(-ph(m + 1 - M));
    pfft_c(fwd_, kernel_.data(), kernel_.data());
    return STATUS_OK;
  }
  ~Zoom() {
    fft_destp_c(fwd_);
    fft_destp_c(inv_);
  }
  int length() const { return L_; }
  // x: M samples; out: K samples; work: length() aligned samples.
  void run(const fcomplex* x, fcomplex* out, double b, fcomplex* work) const {
    for (int n = 0; n < M_; ++n) work[n] = mul(x[n], unit(ph(n) - n * b));
    std::fill(work + M_, work + L_, fcomplex(0.0f, 0.0f));
    pfft_c(fwd_, work, work);
    for (int i = 0; i < L_; ++i) work[i] = mul(work[i], kernel_[i]);
    pfft_c(inv_, work, work);
    for (int k = 0; k < K_; ++k) out[k] = mul(work[k + M_ - 1], post_[k]);
  }

 private:
  double ph(long long n) const { return static_cast<double>(n) * static_cast<double>(n) * a_ / 2.0; }
  static fcomplex unit(double p) {
    return unitPhasor(p);
  }
  int M_ = 0, K_ = 0, L_ = 0;
  double a_ = 0.0;
  FFTPlan fwd_, inv_;
  FFTBuffer kernel_;
  std::vector<fcomplex> post_;
};

// Per-thread row buffers, each aligned for the transforms.
struct RowBuffers {
  FFTBuffer a, b;
  std::vector<double> k, term, P;  // wavenumbers and azimuth weighting of the row
  std::vector<double> phase;       // reference phase of each sample of the row
  std::vector<float> cosv, sinv;   // and its phasor
  std::vector<double> pos;         // input position of each output wavenumber
  std::vector<float> weight;       // weight of each sample of the row
};

bool checkSizes(const AzimuthBlockPar& par, int padded, int M, int n, const double* kx,
                const double* kx2, const double* dk, const char* who) {
  const bool ok = par.lines >= 1 && par.samples >= 1 && padded >= 1 && M >= 1 && n >= 1 &&
                  kx && kx2 && dk &&
                  n <= M && (par.scale == 1.0 ? par.data && n <= par.samples
                                              : par.data && par.out);
  if (!ok) {
    orv_add_report(std::string(who) + ": bad block or output grid sizes", REPORT_ERROR, __LINE__,
                   who, __FILE__);
  }
  return ok;
}

// Inverse azimuth transform of the result, gain normalisation and the
// optional removal of the residual k0 offset.
int finishBlock(const AzimuthBlockPar& par, const StoltGrid& grid, int n, double g) {
  const int nl = par.lines;
  if (wk_column_transform(grid.result, grid.pitch, n, nl, FFT_BACKWARD_NORMALISED) != 0) {
    ORV_REPORT("Cannot make the inverse azimuth transform of the block", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  const float gf = static_cast<float>(g);
#pragma omp parallel for schedule(static)
  for (int j = 0; j < nl; ++j) {
    fcomplex* row = grid.result + static_cast<std::size_t>(j) * grid.pitch;
    for (int i = 0; i < n; ++i) row[i] = fcomplex(row[i].real() / gf, row[i].imag() / gf);
    if (par.final == 1) RngShift(row, n, grid.dr, grid.kzc - grid.k0, row, n, 0.0, 1.0);
  }
  return STATUS_OK;
}

double gainOf(bool active, const std::vector<double>& rowN, const std::vector<double>& rowD) {
  if (!active) return 1.0;
  double N = 0.0, D = 0.0;
  for (std::size_t j = 0; j < rowN.size(); ++j) {
    N += rowN[j];
    D += rowD[j];
  }
  return D > 0.0 ? std::sqrt(N / D) : 1.0;
}

// What the least-squares Stolt kernel needs for one row of a block, and
// the row itself. The row is compiled twice, plain and with AVX2 and FMA
// (the vectors of the tap sums, the square roots and the phasors are twice
// as wide there); a processor runs one of the two for every row, so the
// product does not depend on the number of threads.
struct LSRows {
  const StoltGrid& grid;
  const WKWeighting& wt;
  const QuadTaps& taps;
  const FFTPlan& rowFwd;
  const FFTPlan& inv;
  const fcomplex* data;
  const double* kin;
  const double* rwin;  // null without range window
  const double* kx;
  const double* kx2;
  const fcomplex* back;
  int ns, padded, M, n, H, guard, band0, band1, conj;
  bool weighted;
  float scale;
  double kis, kie, dki, kzc, k0, R2, az, rg;

  __attribute__((always_inline)) void row(int j, RowBuffers& rb, double& N, double& D) const {
    fcomplex* spectrum = rb.a.data() + guard;
    fcomplex* buf = spectrum - H;  // tap m of output u reads buf[u + m]
    fcomplex* line = rb.b.data();
    int ilo, ihi;
    grid.usable(std::sqrt(kis * kis - kx2[j]), std::sqrt(kie * kie - kx2[j]), ilo, ihi);
    std::fill(buf, buf + padded + 2 * H, fcomplex(0.0f, 0.0f));
    std::fill(line, line + M, fcomplex(0.0f, 0.0f));
    N = 0.0;
    D = 0.0;
    if (ihi >= ilo) {
      double* rowTerm = rb.term.data();
      double* rowP = rb.P.data();
      if (weighted) wt.azimuthRow(kin, padded, kx[j], rowTerm, rowP);
      // Weights of the row (window and whitening; 1 without them), and the
      // gain sums over the processed band in four partial sums added in a
      // fixed order.
      float* W = rb.weight.data();
      // First and last sample of non-zero weight.
      int wlo = 0, whi = padded - 1;
      if (weighted) {
        for (int i = 0; i < padded; ++i) W[i] = static_cast<float>(rowTerm[i] * (rwin ? rwin[i] : 1.0));
        while (wlo < padded && W[wlo] == 0.0f) ++wlo;
        while (whi > wlo && W[whi] == 0.0f) --whi;
        double sums[2];
        interleavedSums(band0, band1, [rowP, W](int i, double (&v)[2]) {
          const double P = rowP[i], w = W[i];
          v[0] = P;
          v[1] = P * w * w;
        }, sums);
        D = sums[0];
        N = sums[1];
      }
      // A row the azimuth window leaves out (a fifth of them with a window
      // over 80 % of the band) focuses to zeros: it keeps its gain sums and
      // skips the transforms and the interpolation.
      if (wlo == padded) {
        grid.store(j, line, n);
        return;
      }
      const fcomplex* in = data + static_cast<std::size_t>(j) * ns;
      // The row starts the padded window; R2 moves its content to the middle
      // of the window for the interpolation and R3 moves it back.
      std::copy(in, in + ns, spectrum);
      pfft_c(rowFwd, spectrum, spectrum);
      fftshift(spectrum, padded);
      // The azimuth shift turns with the absolute kx, so that it leaves no
      // centroid-dependent phase on the targets.
      const double azPhase = kx[j] * az;
      double* phase = rb.phase.data();
      const double kx2j = kx2[j];
      // Samples of zero weight stay zero; the others get the reference phase,
      // their weight and the scale.
      for (int i = wlo; i <= whi; ++i) {
        const double k = kin[i];
        phase[i] = (std::sqrt(k * k - kx2j) - kzc) * R2 - (k - k0) * rg + azPhase;
      }
      const float* cs = rb.cosv.data();
      const float* sn = rb.sinv.data();
      wk_phasors(phase + wlo, whi - wlo + 1, rb.cosv.data() + wlo, rb.sinv.data() + wlo);
      float* sp = reinterpret_cast<float*>(spectrum);
      const float im = conj ? -1.0f : 1.0f;
      std::fill(spectrum, spectrum + wlo, fcomplex(0.0f, 0.0f));
      std::fill(spectrum + whi + 1, spectrum + padded, fcomplex(0.0f, 0.0f));
      for (int i = wlo; i <= whi; ++i) {
        const float re = sp[2 * i], ii = im * sp[2 * i + 1];
        const float ws = W[i] * scale;
        sp[2 * i] = (re * cs[i] - ii * sn[i]) * ws;
        sp[2 * i + 1] = (re * sn[i] + ii * cs[i]) * ws;
      }
      // Input positions of the output wavenumbers first, in a loop of its
      // own that the compiler vectorises.
      double* pos = rb.pos.data();
      const double* kzq = grid.kz.data();
      for (int q = ilo; q <= ihi; ++q)
        pos[q - ilo] = std::fabs(std::sqrt(kzq[q] * kzq[q] + kx2j) - kis) / dki;
      for (int q = ilo; q <= ihi; ++q) {
        const double x = pos[q - ilo];
        if (!(x < padded)) continue;  // also rows beyond the geometric limit
        const double u = roundHalfAway(x);
        const int iu = static_cast<int>(u);
        if (iu < 0 || iu >= padded) continue;
        // Taps that reach only samples of zero weight give zero.
        if (iu + H < wlo || iu - H > whi) continue;
        const int r = static_cast<int>(roundHalfAway((x - u) / 0.01)) + 50;
        line[grid.idx[q]] = mul(taps.apply(r, buf + iu), back[q]);
      }
      pfft_c(inv, line, line);
    }
    grid.store(j, line, n);
  }
};

__attribute__((target("avx2,fma"))) void lsRowWide(const LSRows& c, int j, RowBuffers& rb, double& N,
                                                    double& D) {
  c.row(j, rb, N, D);
}

void lsRowPlain(const LSRows& c, int j, RowBuffers& rb, double& N, double& D) { c.row(j, rb, N, D); }

}  // namespace

int ChirpInterpWK(AzimuthBlockPar& par, int padded, int M, int n, const double* kx,
                  const double* kx2, const double* dk, double spacing, double az, double rg) {
  if (!checkSizes(par, padded, M, n, kx, kx2, dk, __func__)) return STATUS_BAD_CONDITION;
  const int nl = par.lines, ns = par.samples;
  const int sign = par.conj ? -1 : 1;

  std::vector<double> rowN, rowD;
  std::unique_ptr<StoltGrid> gridOwner;
  try {
    gridOwner = std::make_unique<StoltGrid>(par, M, n, spacing);
    rowN.assign(nl, 0.0);
    rowD.assign(nl, 0.0);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory in the chirp-z Stolt kernel", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  const StoltGrid& grid = *gridOwner;
  const WKWeighting wt(par);
  const bool A = wt.active;
  const float S = par.conj ? static_cast<float>(nl) : 1.0f;

  // Input grid of the zoomed spectra, relative to k0.
  const int Nin = static_cast<int>(std::lround(static_cast<double>(padded)));
  const double dki = grid.Bk / padded;
  const double kis = -std::floor(Nin / 2) * dki;
  const double kie = kis + (Nin - 1) * dki;
  const double Rp = par.Req / std::cos(grid.sq);

  // Per-thread buffers: the zoomed spectrum (one zero guard sample) with the
  // zoom work area, and the output line.
  Zoom zoom;
  std::vector<RowBuffers> buffers;
  FFTPlan inv;
  try {
    if (zoom.make(ns, Nin, -kTwoPi / padded * sign) != STATUS_OK ||
        fft_makep_c(inv, M, M, 1, 1, FFT_BACKWARD_NORMALISED, FFT_NONE, 1) != 0 ||
        wk_column_transform(par.data, ns, ns, nl, grid.dir) != 0) {
      ORV_REPORT("Cannot make the transform plans of the block", REPORT_ERROR);
      fft_destp_c(inv);
      return STATUS_BAD_CONDITION;
    }
    buffers.resize(threadCount());
    for (RowBuffers& rb : buffers) {
      rb.a.assign(static_cast<std::size_t>(Nin + 1) + zoom.length(), fcomplex(0.0f, 0.0f));
      rb.b.assign(M, fcomplex(0.0f, 0.0f));
      rb.k.resize(Nin);
      rb.term.resize(Nin);
      rb.P.resize(Nin);
    }
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory in the chirp-z Stolt kernel", REPORT_ERROR);
    fft_destp_c(inv);
    return STATUS_NO_MEMORY_ALT;
  }

  const int conj = par.conj;
  const double Req = par.Req;
  const double kzc = grid.kzc, k0 = grid.k0;
#pragma omp parallel for schedule(dynamic, 8)
  for (int j = 0; j < nl; ++j) {
    RowBuffers& rb = buffers[threadIndex()];
    fcomplex* line = rb.b.data();
    fcomplex* zoomWork = rb.a.data();
    fcomplex* G = zoomWork + zoom.length();
    const double fr = dk[j] - std::trunc(dk[j] / dki) * dki;
    const double a = kis - fr, b = kie - fr;
    int ilo, ihi;
    grid.usable(std::sqrt((a + k0) * (a + k0) - kx2[j]), std::sqrt((b + k0) * (b + k0) - kx2[j]),
                ilo, ihi);
    std::fill(line, line + M, fcomplex(0.0f, 0.0f));
    double N = 0.0, D = 0.0;
    if (ihi >= ilo) {
      const fcomplex* row = par.data + static_cast<std::size_t>(j) * ns;
      // Zoomed spectrum of the row on k0 + a + p dki, p = 0 .. Nin - 1.
      zoom.run(row, G, a * (kTwoPi / grid.Bk) * sign, zoomWork);
      G[Nin] = fcomplex(0.0f, 0.0f);
      const double tlo = (std::sqrt(grid.kz[ilo] * grid.kz[ilo] + kx2[j]) - k0 - a) / dki;
      const double thi = (std::sqrt(grid.kz[ihi] * grid.kz[ihi] + kx2[j]) - k0 - a) / dki;
      const int jlo = std::max(0, static_cast<int>(std::floor(tlo)));
      const int jhi = std::min(Nin - 1, static_cast<int>(std::floor(thi)) + 1);
      if (A && jhi >= jlo) {
        for (int p = jlo; p <= jhi; ++p) rb.k[p - jlo] = k0 + a + p * dki;
        wt.azimuthRow(rb.k.data(), jhi - jlo + 1, kx[j], rb.term.data(), rb.P.data());
      }
      for (int p = jlo; p <= jhi; ++p) {
        fcomplex v = G[p];
        if (conj) v = std::conj(v);
        const double k = k0 + a + p * dki;
        const double phase = (std::sqrt(k * k - kx2[j]) - kzc) * Req - (dk[j] + k - k0) * rg;
        v = rotate(v, phase);
        float W = 1.0f;
        if (A) {
          const double P = rb.P[p - jlo];
          W = static_cast<float>(rb.term[p - jlo]);
          if (std::fabs(k - k0) < grid.inBand) {
            D += P;
            N += P * W * W;
          }
        }
        G[p] = scaled(v, W * S);
      }
      // Two-tap interpolation with the phase slope of content at the middle
      // of the range window (minus half a turn per input step) taken out,
      // then the row's azimuth and range references.
      // The azimuth shift turns with the absolute kx, so that it leaves no
      // centroid-dependent phase on the targets.
      const double theta = kx[j] * az + dk[j] * Rp;
      const fcomplex et = unitPhasor(theta);
      for (int q = ilo; q <= ihi; ++q) {
        const double t = (std::sqrt(grid.kz[q] * grid.kz[q] + kx2[j]) - k0 - a) / dki;
        const double u = std::floor(t);
        const double f = t - u;
        const int iu = static_cast<int>(u);
        if (iu < 0 || iu >= Nin) continue;
        // exp(-j pi f) and exp(j pi (1 - f)) = -exp(-j pi f)*.
        double sf, cf;
        wk_sincos(kPi * f, sf, cf);
        const fcomplex w1(static_cast<float>((1.0 - f) * cf), static_cast<float>(-(1.0 - f) * sf));
        const fcomplex w2(static_cast<float>(-f * cf), static_cast<float>(f * sf));
        const fcomplex y = mul(w1, G[iu]) + mul(w2, G[iu + 1]);
        line[grid.idx[q]] = mul(y, et);
      }
      pfft_c(inv, line, line);
    }
    rowN[j] = N;
    rowD[j] = D;
    grid.store(j, line, n);
  }
  fft_destp_c(inv);
  const int st = finishBlock(par, grid, n, gainOf(A, rowN, rowD));
  if (st != STATUS_OK) ORV_REPORT_CALLED_ERROR();
  return st;
}

int LSInterpWK(AzimuthBlockPar& par, int padded, int M, int n, const double* kx,
               const double* kx2, const double* dk, double spacing, double az, double rg) {
  if (!checkSizes(par, padded, M, n, kx, kx2, dk, __func__)) return STATUS_BAD_CONDITION;
  const int H = par.interp;
  if (H < 1 || padded < par.samples) {
    ORV_REPORT("LSInterpWK: bad filter half-length or padded length", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  const int nl = par.lines, ns = par.samples;
  const int taps = 2 * H + 1;

  std::unique_ptr<StoltGrid> gridOwner;
  std::vector<fcomplex> table;
  std::vector<double> kin, rwin, rowN, rowD;
  std::vector<RowBuffers> buffers;
  // The padded spectrum starts at an aligned position after a guard of at
  // least H zeros, and is followed by H zeros.
  const int guard = (H + 7) / 8 * 8;
  try {
    gridOwner = std::make_unique<StoltGrid>(par, M, n, spacing);
    table.resize(static_cast<std::size_t>(kFractions) * taps);
    kin.resize(padded);
    rowN.assign(nl, 0.0);
    rowD.assign(nl, 0.0);
    buffers.resize(threadCount());
    for (RowBuffers& rb : buffers) {
      // Up to three more zeros for the zero taps that end a row of quads.
      rb.a.assign(static_cast<std::size_t>(guard) + padded + H + 3, fcomplex(0.0f, 0.0f));
      rb.b.assign(M, fcomplex(0.0f, 0.0f));
      rb.term.resize(padded);
      rb.P.resize(padded);
      rb.phase.resize(padded);
      rb.cosv.resize(padded);
      rb.sinv.resize(padded);
      rb.pos.resize(M);
      rb.weight.assign(padded, 1.0f);
    }
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory in the least-squares Stolt kernel", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  const StoltGrid& grid = *gridOwner;
  int st = MakeGLS(table.data(), taps, kFractions);
  if (st != STATUS_OK) {
    ORV_REPORT_CALLED_ERROR();
    return st;
  }
  QuadTaps quads;
  try {
    quads.make(table, kFractions, taps);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory in the least-squares Stolt kernel", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  const WKWeighting wt(par);
  const bool A = wt.active;
  const float S = par.conj ? static_cast<float>(static_cast<double>(nl) * padded) : 1.0f;

  // Input grid of the padded spectra, absolute wavenumbers.
  const int po = par.pad == 0.0 ? 0 : (padded - ns) / 2;
  const double dki = grid.Bk / padded;
  const double kis = grid.k0 - std::floor(padded / 2) * dki;
  const double kie = kis + (padded - 1) * dki;
  for (int i = 0; i < padded; ++i) kin[i] = kis + i * dki;
  if (par.rgw != 0.0) {
    rwin.resize(padded);
    for (int i = 0; i < padded; ++i) rwin[i] = wt.rangeTerm(kin[i]);
  }
  // The input samples inside the processed band, where the gain sums run.
  int band0 = padded, band1 = 0;
  for (int i = 0; i < padded; ++i)
    if (std::fabs(kin[i] - grid.k0) < grid.inBand) {
      band0 = std::min(band0, i);
      band1 = i + 1;
    }
  const double R2 = par.Req - po * grid.dr * std::cos(grid.sq);
  const double R3 = po * grid.dr * std::cos(grid.sq);

  // Range reference of the output wavenumbers, the same for every row.
  std::vector<fcomplex> back;
  try {
    back.resize(M);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("Out of memory in the least-squares Stolt kernel", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  for (int q = 0; q < M; ++q) back[q] = unitPhasor((grid.kz[q] - grid.kzc) * R3);

  FFTPlan rowFwd, inv;
  if (fft_makep_c(rowFwd, padded, padded, 1, 1, grid.dir, FFT_NONE, 1) != 0 ||
      fft_makep_c(inv, M, M, 1, 1, FFT_BACKWARD_NORMALISED, FFT_NONE, 1) != 0 ||
      wk_column_transform(par.data, ns, ns, nl, grid.dir) != 0) {
    ORV_REPORT("Cannot make the transform plans of the block", REPORT_ERROR);
    fft_destp_c(rowFwd);
    fft_destp_c(inv);
    return STATUS_BAD_CONDITION;
  }

  const LSRows rows{grid, wt, quads, rowFwd, inv, par.data, kin.data(),
                    rwin.empty() ? nullptr : rwin.data(), kx, kx2, back.data(),
                    ns, padded, M, n, H, guard, band0, band1, par.conj, A, S,
                    kis, kie, dki, grid.kzc, grid.k0, R2, az, rg};
  const auto rowKernel = wideRows() ? lsRowWide : lsRowPlain;
#pragma omp parallel for schedule(dynamic, 8)
  for (int j = 0; j < nl; ++j) rowKernel(rows, j, buffers[threadIndex()], rowN[j], rowD[j]);
  fft_destp_c(rowFwd);
  fft_destp_c(inv);
  st = finishBlock(par, grid, n, gainOf(A, rowN, rowD));
  if (st != STATUS_OK) ORV_REPORT_CALLED_ERROR();
  return st;
}
