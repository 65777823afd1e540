#pragma once
#include <cmath>
#include <functional>

#include "base/fcomplex.h"
#include "core/fft.h"

// Omega-K focusing of one azimuth block: the block parameter record, the
// wavenumber grids and the kernels. A block is stored as `lines` rows, each
// of `samples` range samples.

struct AzimuthBlockPar {
  int verbose = 0;
  int lines = 0;             // azimuth rows in the block
  int samples = 0;           // range samples per row
  double fc = 0.0;           // carrier, Hz
  double frg = 0.0;          // range sampling rate, Hz
  double dc = 0.0;           // Doppler centroid, Hz
  double scale = 1.0;        // output spacing factor, 1.0 = keep the grid
  double azshift = 0.0;      // azimuth shift, s (== lines: automatic)
  double rgshift = 0.0;      // range shift, s (== samples: automatic)
  int reestimate = 0;        // 1 = re-estimate the centroid per block
  double prf = 0.0;          // Hz
  double fr0 = 0.0;          // Doppler rate: constant,
  double fr1 = 0.0;          //   linear
  double fr2 = 0.0;          //   and quadratic in fast time
  double t0 = 0.0;           // fast time of sample 0, s
  double trg0 = 0.0;         // rate polynomial reference, s
  double AntennaLength = 0.0;  // m
  double azw = 0.0;          // azimuth window pedestal, 0 = no window
  double rgw = 0.0;          // range window pedestal, 0 = no window
  double azlook = 0.0;       // azimuth look bandwidth, Hz
  double rglook = 0.0;       // range look bandwidth, Hz
  double aztrans = 0.0;      // azimuth transition bandwidth, Hz
  double rgtrans = 0.0;      // range transition bandwidth, Hz
  int whiten = 0;            // antenna pattern whitening
  int conj = 0;              // 1 = conjugated processing
  fcomplex* data = nullptr;  // the block
  fcomplex* out = nullptr;   // separate output block, used when scale != 1.0
  double Req = 0.0;          // equivalent near range, m
  double Veq = 0.0;          // equivalent speed, m/s
  int interp = 0;            // 0 FastWK, 1 ChirpInterpWK, >1 LSInterpWK taps per side
  double pad = 0.0;          // Stolt padding fraction
  double dcref = 0.0;        // fixed reference centroid, 0 = none
  double bw = 0.0;           // range bandwidth, Hz
  int final = 0;             // 1 = remove the residual k0 offset at the end
  double range0 = 0.0;       // slant range of output sample 0 of the block, m
                             // (0: the range of input sample overlap/2)
  double fr0y = 0.0;         // change of fr0 per second of azimuth time
  double fr1y = 0.0;         //   and of fr1
  double fr3 = 0.0;          // cubic term of the Doppler rate in fast time
};

// What focazwk tells its caller about the block it focused.
struct AzimuthBlockOut {
  int lines = 0;
  int samples = 0;
  double spacing = 0.0;  // range spacing, m
  double dc = 0.0;       // centroid used, Hz
  double aztime = 0.0;   // azimuth time offset, s
  double rgtime = 0.0;   // range time offset, s
};

// Equivalent speed and range (par.Veq, par.Req) from the Doppler rate at near
// and far range of the block. 1 (with a report) when the rate does not vary
// over the block, which leaves the geometry undefined.
int MyComputeEqPar(AzimuthBlockPar& par);

// k0 = 4 pi fc / c; kx from dc (or dcref when set); kz = sqrt(k0^2 - kx^2).
void ComputeWaveNumbers(const AzimuthBlockPar& par, double& k0, double& kx, double& kz);

// Angular aperture and the azimuth (a, b) and range (c, d) window fractions.
// Resets par.azw / par.rgw to 0 (with a message) when the look bandwidth is
// larger than the sampled one.
void WindowPars(AzimuthBlockPar& par, double& aperture, double& a, double& b, double& c,
                double& d);

// Azimuth wavenumbers of the block rows in transform order, wrapped around dc
// modulo prf: kx, kx^2 and dk = k0 - sqrt(kx^2 + kz^2). Arrays of par.lines.
void AzimuthGrid(const AzimuthBlockPar& par, double* kx, double* kx2, double* dk);

// Azimuth and range reference distances (m) of the block.
void ShiftDistances(const AzimuthBlockPar& par, double& az, double& rg);

// out[i] = in[i] exp(j (i step k + k offset)) / divisor for i < n, then zeros
// up to `total`. `in` may equal `out`.
void RngShift(const fcomplex* in, int n, double step, double k, fcomplex* out, int total,
              double offset, double divisor);

// Output grid of the block: FFT length, range spacing (m), padded input
// length and output samples. 1 when the squint reaches the geometric limit.
int OutImagePar(const AzimuthBlockPar& par, int& fftlen, double& spacing, int& padded,
                int& outsamples);

// Focuses par.data in place (or into par.out) with the kernel chosen by
// par.interp.
int focazwk(AzimuthBlockPar& par, AzimuthBlockOut& out);

// A block held as a strip of its columns, `pitch` samples a row, that
// follows the range sub-blocks across the block. Before each sub-block
// multirg asks for its columns [first, first + count): `columns` makes them
// present (the columns left of `first` hold focused samples and are no
// longer needed) and sets `at` to column `first` of the block's row 0.
// Status 0, else the status multirg returns. count never exceeds pitch.
struct BlockStrip {
  int pitch = 0;
  std::function<int(int first, int count, fcomplex*& at)> columns;
};

// Walks the block in overlapping range sub-blocks of `subSamples` samples,
// `overlap` the full overlap. poly[5]: Doppler centroid in fast time about
// `tref`. block / blocks feed the progress bar. Each sub-block leaves its
// targets at a phase offset (k0 - kz) Rq from -k0 R0, kz its reference
// wavenumber and Rq the target's range in the sub-block's equivalent
// geometry; it is taken out as the sub-block is copied back, so that every
// target ends at -k0 R0 whatever the centroid. par.range0 gives the slant
// range of the block's first output sample. `scratch`, when given, holds the
// sub-block work area from one block to the next (a fresh one per block
// costs the clearing of its pages). `strip`, when given, holds the block as
// a strip of its columns rather than whole (see BlockStrip).
int multirg(AzimuthBlockPar& par, AzimuthBlockOut& out, int subSamples, int overlap,
            const double poly[5], double tref, int block = 0, int blocks = 1,
            FFTBuffer* scratch = nullptr, const BlockStrip* strip = nullptr);

// Doppler rate that drifts along the azimuth time of a block (fr0y, fr1y):
// a target's range history follows the equivalent speed of its own beam
// centre time, so one speed per block leaves a phase that grows with the
// square of the centroid and a position error that grows with the centroid,
// both linear in the target's time. wk_rate_drift measures the drift for the
// current sub-block (par.t0, par.samples, par.dc): the relative change of
// the speed per second, from the rate at the sub-block centre, and the
// beam-centre time of a target before its zero-Doppler time. It is applied (active) where it would move
// a phase by more than a degree and the drift is one an orbit can have.
struct WKRateDrift {
  bool active = false;
  double alpha = 0.0;    // relative change of the speed per second (half the rate's)
  double beamLead = 0.0; // beam-centre time minus zero-Doppler time, s
};
WKRateDrift wk_rate_drift(const AzimuthBlockPar& par);

// Copies `lines` rows of n samples from src (row pitch srcPitch) to dst
// (pitch dstPitch), resampled along azimuth: row j is read alpha (u^2 -
// lead^2) / 2 seconds later, u = (j - lines/2) / prf + offset, by a
// band-limited derivative about each column's absolute centroid
// centroidHz[i]. With -alpha, offset 0 and lead 0 the echoes of a block look
// flown at the one speed of its centre row; that leaves a target at
// zero-Doppler time t0 at t0 + alpha ((t0 - t_c)^2 - lead^2) / 2 (t_c the
// block centre, lead the beam-centre time before t0), which alpha, the
// azimuth shift as offset and the lead take back on the focused rows.
void wk_resample_rows(const fcomplex* src, int srcPitch, fcomplex* dst, int dstPitch, int lines,
                      int n, double prf, double alpha, double offset, double lead,
                      const double* centroidHz);

// Transforms the first `used` columns (each `lines` long) of a row-major
// block of row pitch `pitch` along azimuth, `direction` an FFT direction
// code. Strips of columns are gathered into contiguous rows, transformed
// and scattered back, which keeps the memory access sequential. Status 0;
// 1 for bad sizes; 5 when the transform cannot be made; 7 out of memory.
int wk_column_transform(fcomplex* data, int pitch, int used, int lines, int direction);

// Omega-K kernel without Stolt interpolation.
int FastWK(AzimuthBlockPar& par, const double* kx, const double* kx2, const double* dk,
           double az, double rg);

// Raised-cosine rule: 1 for excess <= 0, pedestal + (1 - pedestal) cos(pi
// excess / width) for excess below width, else 0.
double wk_raised_cosine(double excess, double width, double pedestal);

// Antenna pattern term P = sc^4 + sm^4 + sp^4 with L = AntennaLength fc / c
// and Bx = 2 pi prf / Veq, at squint sq, wavenumber k and row wavenumber kx.
double wk_pattern_term(double L, double sq, double k, double kx, double Bx);

// Per-block set-up of the weighting shared by the omega-K kernels: the
// pattern term, whitening and the azimuth and range windows.
struct WKWeighting {
  bool active = false;  // any of rgw, azw, whiten
  int whiten = 0;
  double azw = 0.0, rgw = 0.0;
  double aperture = 0.0, a = 0.0, b = 0.0, c = 0.0, d = 0.0;
  double L = 0.0, Bx = 0.0, Bk = 0.0, sq = 0.0, k0 = 0.0;
  double ssq = 0.0, csq = 1.0;  // sin and cos of sq
  // Calls WindowPars on par (so it may reset par.azw / par.rgw).
  explicit WKWeighting(AzimuthBlockPar& par);
  // Range window term of wavenumber k (1 when rgw is 0).
  double rangeTerm(double k) const;
  // Whitening times azimuth window at (k, kx); P receives the pattern term.
  double azimuthTerm(double k, double kx, double& P) const;
  // Which piece of the azimuth window rule holds at (k, kx): 0 full weight,
  // 1 transition, 2 outside (always 0 without an azimuth window).
  int azimuthPiece(double k, double kx) const;
  // azimuthTerm over the n wavenumbers k[i] of one row: exact on every
  // 32nd sample and the last one, linear in between where the window rule
  // keeps its piece (a row's wavenumbers span a few parts in 1e3 of k0, so
  // the terms are smooth in k: within parts in 1e7, float resolution),
  // exact elsewhere. term[i] and P[i] receive the two results.
  void azimuthRow(const double* k, int n, double kx, double* term, double* P) const;
};

// sin and cos for the phase rotations of the kernels: the argument is
// reduced by pi/2 in two steps (exact for |x| below 1e6, which covers the
// range phases of any block) and the quadrant polynomials keep the result
// within a unit or two of the last double place. Larger or non-finite
// arguments go to the library functions.
namespace wk_detail {
// r = x - q pi/2 with |r| <= pi/4 (a hair more at the ends), q mod 4.
inline double reduce(double x, int& q) {
  constexpr double invpio2 = 6.36619772367581382433e-01;
  constexpr double pio2_1 = 1.57079632673412561417e+00;   // first 33 bits of pi/2
  constexpr double pio2_1t = 6.07710050650619224932e-11;  // pi/2 - pio2_1
  constexpr double shifter = 6755399441055744.0;          // 1.5 * 2^52
  const double fn = (x * invpio2 + shifter) - shifter;
  q = static_cast<int>(fn) & 3;
  return (x - fn * pio2_1) - fn * pio2_1t;
}
inline double sinPoly(double r, double z) {
  return r + r * z *
                 (-1.66666666666666324348e-01 +
                  z * (8.33333333332248946124e-03 +
                       z * (-1.98412698298579493134e-04 +
                            z * (2.75573137070700676789e-06 +
                                 z * (-2.50507602534068634195e-08 +
                                      z * 1.58969099521155010221e-10)))));
}
inline double cosPoly(double z) {
  return 1.0 - 0.5 * z +
         z * z *
             (4.16666666666666019037e-02 +
              z * (-1.38888888888741095749e-03 +
                   z * (2.48015872894767294178e-05 +
                        z * (-2.75573143513906633035e-07 +
                             z * (2.08757232129817482790e-09 +
                                  z * -1.13596475577881948265e-11)))));
}
}  // namespace wk_detail

inline void wk_sincos(double x, double& s, double& c) {
  if (!(std::fabs(x) < 1.0e6)) {
    s = std::sin(x);
    c = std::cos(x);
    return;
  }
  int q;
  const double r = wk_detail::reduce(x, q);
  const double z = r * r;
  const double sr = wk_detail::sinPoly(r, z), cr = wk_detail::cosPoly(z);
  const double ss = (q & 1) ? cr : sr;
  const double cc = (q & 1) ? sr : cr;
  s = (q & 2) ? -ss : ss;
  c = ((q + 1) & 2) ? -cc : cc;
}

inline double wk_sin(double x) {
  if (!(std::fabs(x) < 1.0e6)) return std::sin(x);
  int q;
  const double r = wk_detail::reduce(x, q);
  const double z = r * r;
  const double v = (q & 1) ? wk_detail::cosPoly(z) : wk_detail::sinPoly(r, z);
  return (q & 2) ? -v : v;
}

// cos and sin of x[i], i < n, narrowed to float: the values of wk_sincos
// (up to the sign of an exact zero), computed by a branch-free loop that the
// compiler vectorises when every argument is below 1e6 in magnitude (else
// element by element). The quadrant selects and signs are products with 0,
// 1 or -1, which are exact.
inline void wk_phasors(const double* x, int n, float* c, float* s) {
  int large = 0;
  for (int i = 0; i < n; ++i) large += !(std::fabs(x[i]) < 1.0e6);
  if (large != 0) {
    for (int i = 0; i < n; ++i) {
      double sd, cd;
      wk_sincos(x[i], sd, cd);
      c[i] = static_cast<float>(cd);
      s[i] = static_cast<float>(sd);
    }
    return;
  }
  for (int i = 0; i < n; ++i) {
    int q;
    const double r = wk_detail::reduce(x[i], q);
    const double z = r * r;
    const double sr = wk_detail::sinPoly(r, z), cr = wk_detail::cosPoly(z);
    const double odd = static_cast<double>(q & 1);
    const double ss = odd * cr + (1.0 - odd) * sr;
    const double cc = odd * sr + (1.0 - odd) * cr;
    s[i] = static_cast<float>(ss * static_cast<double>(1 - (q & 2)));
    c[i] = static_cast<float>(cc * static_cast<double>(1 - ((q + 1) & 2)));
  }
}

// x * exp(j phase), the rotation narrowed to float.
inline fcomplex wk_rotate(fcomplex x, double phase) {
  double sd, cd;
  wk_sincos(phase, sd, cd);
  const float c = static_cast<float>(cd), s = static_cast<float>(sd);
  return fcomplex(x.real() * c - x.imag() * s, x.real() * s + x.imag() * c);
}
