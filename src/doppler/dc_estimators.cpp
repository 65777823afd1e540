#include "doppler/dc_estimators.h"

#include <algorithm>
#include <cfloat>
#include <cmath>
#include <cstdio>
#include <memory>
#include <new>

#include "base/constants.h"
#include "base/status.h"
#include "core/fft.h"
#include "diag/report.h"
#include "doppler/dc_polynomial.h"
#include "numerics/filter_design.h"
#include "numerics/fitting.h"

namespace {

constexpr double kPi = consts::kPi;
constexpr int kHistBins = 1024;

// Rounds half away from zero.
long roundHalfAway(double v) { return v < 0.0 ? -std::lround(-v) : std::lround(v); }

template <class T>
int makeHistT(const T* values, int n, double* step, double* min, int* hist, int nbins) {
  if (!values || n < 1 || !hist || nbins < 1) {
    ORV_REPORT("make_hist: empty value set or no bins", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  double lo = values[0], hi = values[0];
  for (int i = 1; i < n; ++i) {
    lo = std::min(lo, static_cast<double>(values[i]));
    hi = std::max(hi, static_cast<double>(values[i]));
  }
  *min = lo;
  *step = nbins > 1 ? (hi - lo) / (nbins - 1) : 0.0;
  std::fill(hist, hist + nbins, 0);
  for (int i = 0; i < n; ++i) {
    const int b = std::clamp(hist_bin(values[i], lo, *step), 0, nbins - 1);
    ++hist[b];
  }
  return STATUS_OK;
}

// Set-up of the multi-look beat frequency estimator.
struct MlbfSetup {
  int fLength = 0;
  int nMlbf = 0;
  std::vector<double> dist;
  // Filters of distance i: look one at taps[(2 i) fLength], look two at
  // taps[(2 i + 1) fLength].
  std::vector<fcomplex> taps;
  CZTPlan czt{};
  bool cztReady = false;
  int cztOut = 0;       // output points of the search
  double f0 = 0.0;      // start of the search, cycles per line
  ~MlbfSetup() {
    if (cztReady) czt_destp_c(czt);
  }
};

// Set-up of the phase-slope estimator.
struct WdarSetup {
  FFTPlan plan{};
  bool planReady = false;
  int blocks = 0;
  int blockl = 0;
  std::vector<int> inBand;  // in-band range bins in order of increasing frequency
  ~WdarSetup() {
    if (planReady) fft_destp_c(plan);
  }
};

std::unique_ptr<MlbfSetup> g_mlbf;
std::unique_ptr<WdarSetup> g_wdar;

// 3-point parabola vertex offset around index k of y.
double parabolaOffset(double ym, double y0, double yp) {
  const double den = ym - 2.0 * y0 + yp;
  if (den == 0.0) return 0.0;
  return 0.5 * (ym - yp) / den;
}

}  // namespace

int hist_bin(double v, double min, double step) {
  if (!(step > 0.0)) return 0;
  const double b = (v - min) / step;
  if (!std::isfinite(b)) return 0;
  return static_cast<int>(roundHalfAway(std::clamp(b, -1e9, 1e9)));
}

int make_hist(const float* values, int n, double* step, double* min, int* hist, int nbins) {
  return makeHistT(values, n, step, min, hist, nbins);
}

int make_hist(const double* values, int n, double* step, double* min, int* hist, int nbins) {
  return makeHistT(values, n, step, min, hist, nbins);
}

void my_qsort(int lo, int hi, float* keys, int* idx) {
  // Quick sort with the middle element as pivot; recursion on the smaller
  // part keeps the stack depth logarithmic.
  while (lo < hi) {
    const float pivot = keys[lo + (hi - lo) / 2];
    int i = lo, j = hi;
    while (i <= j) {
      while (keys[i] < pivot) ++i;
      while (keys[j] > pivot) --j;
      if (i <= j) {
        std::swap(keys[i], keys[j]);
        std::swap(idx[i], idx[j]);
        ++i;
        --j;
      }
    }
    if (j - lo < hi - i) {
      my_qsort(lo, j, keys, idx);
      lo = i;
    } else {
      my_qsort(i, hi, keys, idx);
      hi = j;
    }
  }
}

int sel_no_overlap(int* x, int* y, int count, int width, int height, double sx, double sy) {
  const int cx = std::max(1, static_cast<int>(std::ceil(sx)));
  const int cy = std::max(1, static_cast<int>(std::ceil(sy)));
  // Kept points in buckets of cx x cy cells: a point closer than cx and cy
  // to a candidate lies in the candidate's bucket or one of its eight
  // neighbours, so each candidate looks at a few points, not at all kept.
  const int bw = width / cx + 1, bh = height / cy + 1;
  std::vector<std::vector<int>> buckets(static_cast<std::size_t>(bw) * bh);
  int kept = 0;
  for (int i = 0; i < count; ++i) {
    if (x[i] < 0) continue;
    const double left = x[i] - sx / 2.0, top = y[i] - sy / 2.0;
    bool drop = left < 0.0 || top < 0.0 || left + sx > width || top + sy > height;
    const int bx = std::clamp(x[i] / cx, 0, bw - 1), by = std::clamp(y[i] / cy, 0, bh - 1);
    for (int v = std::max(0, by - 1); !drop && v <= std::min(bh - 1, by + 1); ++v)
      for (int u = std::max(0, bx - 1); !drop && u <= std::min(bw - 1, bx + 1); ++u)
        for (int k : buckets[static_cast<std::size_t>(v) * bw + u])
          if (std::abs(x[i] - x[k]) < cx && std::abs(y[i] - y[k]) < cy) {
            drop = true;
            break;
          }
    if (drop) {
      x[i] = -1;
    } else {
      buckets[static_cast<std::size_t>(by) * bw + bx].push_back(i);
      ++kept;
    }
  }
  return kept;
}

int topNpoints(const float* map, std::vector<MapPoint>& out, int n, int width, int height,
               double sx, double sy, int* found) {
  out.clear();
  *found = 0;
  if (!map || width < 1 || height < 1) {
    ORV_REPORT("topNpoints: empty map", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (n < 1) return STATUS_OK;
  const int cells = width * height;
  std::vector<int> hist(kHistBins);
  double step = 0.0, min = 0.0;
  if (int s = make_hist(map, cells, &step, &min, hist.data(), kHistBins); s != 0) {
    ORV_REPORT_CALLED_ERROR();
    return s;
  }
  // Survivors of every round, best first: candidates are taken from the
  // highest bins down, n more each round, and each round is sorted and
  // thinned again from scratch.
  std::vector<int> cx, cy;
  std::vector<float> keys;
  std::vector<int> idx;
  int lowestBin = kHistBins;  // bins >= lowestBin are collected
  int wanted = 0;
  int kept = 0;
  // The candidates grow by n, then by twice as many each round: the greedy
  // thinning in descending order keeps the same first survivors on any
  // larger candidate set, and a large n on a map of many equal cells (the
  // low-contrast blocks of a whole scene) then takes a few rounds, not
  // thousands.
  int grow = n;
  while (lowestBin > 0 && kept < n) {
    wanted += grow;
    grow = grow > (1 << 29) ? grow : 2 * grow;
    int held = 0;
    for (int b = kHistBins - 1; b >= 0; --b) {
      held += hist[b];
      if (held >= wanted || b == 0) {
        lowestBin = std::min(lowestBin, b);
        break;
      }
    }
    keys.clear();
    idx.clear();
    for (int i = 0; i < cells; ++i) {
      if (hist_bin(map[i], min, step) >= lowestBin) {
        keys.push_back(map[i]);
        idx.push_back(i);
      }
    }
    if (!keys.empty()) my_qsort(0, static_cast<int>(keys.size()) - 1, keys.data(), idx.data());
    // Descending order of value.
    const int m = static_cast<int>(idx.size());
    cx.assign(m, 0);
    cy.assign(m, 0);
    for (int i = 0; i < m; ++i) {
      const int id = idx[m - 1 - i];
      cx[i] = id % width;
      cy[i] = id / width;
    }
    kept = sel_no_overlap(cx.data(), cy.data(), m, width, height, sx, sy);
    if (lowestBin == 0) break;
  }
  for (int i = 0; i < static_cast<int>(cx.size()) && static_cast<int>(out.size()) < n; ++i) {
    if (cx[i] < 0) continue;
    out.push_back(MapPoint{cx[i], cy[i], map[cy[i] * width + cx[i]]});
  }
  *found = static_cast<int>(out.size());
  return STATUS_OK;
}

std::vector<double> mlbfLookDistances(const DcEstState& st) {
  std::vector<double> d;
  if (st.nMlbf < 1) return d;
  const double first = 2.0 * st.lookBf * st.rgBand;
  const double span = (1.0 - st.lookBf) * st.rgBand - first;
  const double s = st.nMlbf > 1 ? span / (st.nMlbf - 1) : span;
  for (int i = 0; i < st.nMlbf; ++i) d.push_back(first + i * s);
  return d;
}

int multimlbf_init(DcEstState& st) {
  g_mlbf.reset();
  if (st.nMlbf < 1) {
    ORV_REPORT("mlbf_init: number of look distances below 1", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  if (st.fLength < 1) {
    ORV_REPORT("mlbf_init: filter length below 1", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  if (st.fLength % 2 == 0) {
    st.fLength += 1;
    std::printf("\nWARNING from mlbf_init(): Remez filter length must be odd. Filter length is set to : %d.",
                st.fLength);
    std::fflush(stdout);
  }
  try {
    auto setup = std::make_unique<MlbfSetup>();
    setup->fLength = st.fLength;
    setup->nMlbf = st.nMlbf;
    std::vector<fcomplex> lowpass(st.fLength);
    const double bands[4] = {0.0, (st.lookBf - st.lookBt) * st.rgBand / 2.0,
                             (st.lookBf + st.lookBt) * st.rgBand / 2.0, 0.5};
    const double desired[2] = {1.0, 0.0};
    const double weights[2] = {1.0, st.lookRs != 0.0 ? st.lookRp / st.lookRs : 1.0};
    if (int s = remez(lowpass.data(), st.fLength, 2, bands, desired, weights); s != 0) {
      ORV_REPORT_CALLED_ERROR();
      return s;
    }
    setup->dist = mlbfLookDistances(st);
    st.lookDist = setup->dist;
    setup->taps.resize(static_cast<std::size_t>(2) * st.nMlbf * st.fLength);
    for (int i = 0; i < st.nMlbf; ++i) {
      fcomplex* up = &setup->taps[static_cast<std::size_t>(2 * i) * st.fLength];
      fcomplex* down = up + st.fLength;
      for (int k = 0; k < st.fLength; ++k) {
        const double ph = kPi * setup->dist[i] * k;
        const fcomplex rot(static_cast<float>(std::cos(ph)), static_cast<float>(std::sin(ph)));
        up[k] = lowpass[k] * rot;
        down[k] = lowpass[k] * std::conj(rot);
      }
    }
    g_mlbf = std::move(setup);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("mlbf_init: out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  return STATUS_OK;
}

int chirpZ_init(DcEstState& st) {
  if (!g_mlbf) {
    ORV_REPORT("chirpZ_init: MLBF not initialised", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  if (g_mlbf->cztReady) {
    czt_destp_c(g_mlbf->czt);
    g_mlbf->cztReady = false;
  }
  if (st.fc <= 0.0 || st.fs <= 0.0 || st.dftStep <= 0.0 || st.blockl < 3) {
    ORV_REPORT("chirpZ_init: carrier, sampling rate, search step or block length not positive",
               REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  const double dmax = g_mlbf->dist.back();
  const double ratio = st.fs / st.fc;
  const double len = std::ceil(ratio * dmax * std::fabs(st.maxAmb - st.minAmb) / st.dftStep);
  if (!(len >= 3.0) || len > 1e8) {
    ORV_REPORT("chirpZ_init: empty or oversized beat frequency search (check Minamb, Maxamb, Dftstep)",
               REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  g_mlbf->cztOut = static_cast<int>(len);
  g_mlbf->f0 = ratio * dmax * st.minAmb;
  if (czt_makep_c(g_mlbf->czt, st.blockl, g_mlbf->cztOut) != 0) {
    ORV_REPORT("chirpZ_init: transform plan failed", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  g_mlbf->cztReady = true;
  return STATUS_OK;
}

bool multimlbf_ready() { return g_mlbf && g_mlbf->cztReady; }

void multimlbf_close() { g_mlbf.reset(); }

int multimlbf(DcEstState& st, int blockIndex) {
  if (!multimlbf_ready()) return STATUS_BAD_CONDITION;
  MlbfSetup& set = *g_mlbf;
  if (blockIndex < 0 || blockIndex >= static_cast<int>(st.mlbfBlocks.size())) {
    ORV_REPORT("multimlbf: block index out of range", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  const int ns = st.blocks, nl = st.blockl;
  if (static_cast<long>(st.blockBuf.size()) < static_cast<long>(ns) * nl || nl != set.czt.M) {
    ORV_REPORT("multimlbf: block buffer does not match the set-up", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  const int dec = std::max(1, st.decFac);
  const int nd = (ns + dec - 1) / dec;
  const int half = (set.fLength - 1) / 2;
  const int K = set.cztOut;
  MlbfBlock& blk = st.mlbfBlocks[blockIndex];
  blk.estimates.assign(set.nMlbf, 0.0);
  blk.quality.assign(set.nMlbf, 0.0);
  try {
    std::vector<fcomplex> beat(static_cast<std::size_t>(nd) * nl);
    std::vector<fcomplex> spec(static_cast<std::size_t>(nd) * K);
    std::vector<double> power(K);
    for (int i = 0; i < set.nMlbf; ++i) {
      if (st.verbose) std::printf("Evaluating MLBF %d of %d... ", i + 1, set.nMlbf);
      const fcomplex* up = &set.taps[static_cast<std::size_t>(2 * i) * set.fLength];
      const fcomplex* down = up + set.fLength;
      // Both looks of every line, filtered along range at the kept
      // (decimated) samples only, beat and stored azimuth-fastest; lines are
      // independent.
#pragma omp parallel for schedule(static)
      for (int l = 0; l < nl; ++l) {
        const fcomplex* line = &st.blockBuf[static_cast<std::size_t>(l) * ns];
        for (int j = 0; j < nd; ++j) {
          const int n = j * dec;
          // Taps whose sample lies inside the line, in ascending order.
          const int k0 = std::max(0, n + half - (ns - 1));
          const int k1 = std::min(set.fLength - 1, n + half);
          double ar = 0.0, ai = 0.0, br = 0.0, bi = 0.0;
          for (int k = k0; k <= k1; ++k) {
            const fcomplex x = line[n + half - k];
            const double xr = x.real(), xi = x.imag();
            const double ur = up[k].real(), ui = up[k].imag();
            const double dr = down[k].real(), di = down[k].imag();
            ar += ur * xr - ui * xi;
            ai += ur * xi + ui * xr;
            br += dr * xr - di * xi;
            bi += dr * xi + di * xr;
          }
          std::complex<double> z = std::complex<double>(ar, ai) * std::conj(std::complex<double>(br, bi));
          // The beat's magnitude from its squared norm: no overflow is
          // possible at these values, and hypot costs a quarter of the block.
          const double mag = std::sqrt(std::norm(z));
          z /= std::max(mag, static_cast<double>(FLT_MIN));
          beat[static_cast<std::size_t>(j) * nl + l] = fcomplex(z);
        }
      }
      if (pczt_c(set.czt, beat.data(), spec.data(), -2.0 * kPi * st.dftStep, 2.0 * kPi * set.f0, nd) != 0) {
        ORV_REPORT("multimlbf: chirp-z transform failed", REPORT_ERROR);
        return STATUS_BAD_CONDITION;
      }
      std::fill(power.begin(), power.end(), 0.0);
      for (int j = 0; j < nd; ++j)
        for (int k = 0; k < K; ++k) power[k] += std::norm(spec[static_cast<std::size_t>(j) * K + k]);
      const int kp = static_cast<int>(std::max_element(power.begin(), power.end()) - power.begin());
      double off = 0.0;
      if (kp > 0 && kp < K - 1) off = parabolaOffset(power[kp - 1], power[kp], power[kp + 1]);
      const double f = set.f0 + (kp + off) * st.dftStep;
      const double peak = power[kp];
      const int w = static_cast<int>(std::ceil(st.peakWid / st.dftStep / 2.0));
      for (int k = std::max(0, kp - w); k <= std::min(K - 1, kp + w); ++k) power[k] = 0.0;
      const double side = *std::max_element(power.begin(), power.end());
      blk.quality[i] = peak / std::max(side, static_cast<double>(FLT_MIN));
      blk.estimates[i] = (st.fc / st.fs) / set.dist[i] * f;
      if (st.verbose) std::printf("estimation: %f... \n", blk.estimates[i]);
    }
  } catch (const std::bad_alloc&) {
    ORV_REPORT("multimlbf: out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  return STATUS_OK;
}

int wdar_init(DcEstState& st) {
  g_wdar.reset();
  if (st.blocks < 2 || st.blockl < 2) {
    ORV_REPORT("wdar_init: block smaller than 2 x 2 samples", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  try {
    auto setup = std::make_unique<WdarSetup>();
    setup->blocks = st.blocks;
    setup->blockl = st.blockl;
    if (fft_makep_c(setup->plan, st.blocks, st.blocks, st.blockl, st.blockl, FFT_FORWARD, FFT_NONE, 1) != 0) {
      ORV_REPORT("wdar_init: transform plan failed", REPORT_ERROR);
      return STATUS_BAD_CONDITION;
    }
    setup->planReady = true;
    auto inBand = [&](int k) {
      const double r = static_cast<double>(k) / st.blocks;
      return r <= st.rgBand / 2.0 || r >= 1.0 - st.rgBand / 2.0;
    };
    for (int k = st.blocks / 2; k < st.blocks; ++k)
      if (inBand(k)) setup->inBand.push_back(k);
    for (int k = 0; k < st.blocks / 2; ++k)
      if (inBand(k)) setup->inBand.push_back(k);
    g_wdar = std::move(setup);
  } catch (const std::bad_alloc&) {
    ORV_REPORT("wdar_init: out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  return STATUS_OK;
}

bool wdar_ready() { return static_cast<bool>(g_wdar); }

void wdar_close() { g_wdar.reset(); }

int wdar(DcEstState& st, const double poly[7], int blockIndex) {
  if (!g_wdar) return -1;
  const int ns = g_wdar->blocks, nl = g_wdar->blockl;
  if (static_cast<long>(st.blockBuf.size()) < static_cast<long>(ns) * nl) {
    ORV_REPORT("wdar: block buffer does not match the set-up", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  (void)poly;
  try {
    FFTBuffer work(st.blockBuf.begin(), st.blockBuf.begin() + static_cast<long>(ns) * nl);
    return wdarInPlace(st, blockIndex, work.data());
  } catch (const std::bad_alloc&) {
    ORV_REPORT("wdar: out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
}

int wdarInPlace(DcEstState& st, int blockIndex, fcomplex* work) {
  if (!g_wdar) return -1;
  const WdarSetup& set = *g_wdar;
  if (blockIndex < 0 || blockIndex >= static_cast<int>(st.wdarBlocks.size())) {
    ORV_REPORT("wdar: block index out of range", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  const int ns = set.blocks, nl = set.blockl;
  if (st.blocks != ns || st.blockl != nl) {
    ORV_REPORT("wdar: block buffer does not match the set-up", REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  WdarBlock& blk = st.wdarBlocks[blockIndex];
  try {
    pfft_c(set.plan, work, work);
    // Lag-one azimuth correlation per range frequency (rows are lines, so the
    // azimuth neighbour of a sample is one row further).
    std::vector<std::complex<double>> corr(ns, std::complex<double>(0.0, 0.0));
    const int nb = static_cast<int>(set.inBand.size());
#pragma omp parallel for schedule(static)
    for (int b = 0; b < nb; ++b) {
      const int k = set.inBand[b];
      if (k == 0) continue;
      std::complex<double> r(0.0, 0.0);
      for (int l = 0; l + 1 < nl; ++l)
        r += std::conj(std::complex<double>(work[static_cast<std::size_t>(l) * ns + k])) *
             std::complex<double>(work[static_cast<std::size_t>(l + 1) * ns + k]);
      corr[k] = r;
    }
    std::complex<double> total(0.0, 0.0);
    for (int k : set.inBand) total += corr[k];
    // The lag-one phase at range frequency fr is 2 pi fdc (1 + fr / fc) / PRF
    // modulo 2 pi: relative to the phase of the whole band it is a line in
    // fr whose slope is the absolute centroid, far below one cycle across
    // the band for any centroid of a few PRF, so it needs no unwrapping.
    // Weighted least squares of that phase against the normalised range
    // frequency, each bin weighted by its correlation magnitude. Working on
    // the phase relative to the band's own removes the PRF wrap that a
    // phase taken against a reference outside the data would bring in.
    const double tabs = std::abs(total);
    double sw = 0.0, swx = 0.0;
    for (int k : set.inBand) {
      if (k == 0) continue;
      const double x = (k < ns / 2 ? k : k - ns) / static_cast<double>(ns);
      const double w = std::abs(corr[k]);
      sw += w;
      swx += w * x;
    }
    double slope = 0.0;
    if (sw > 0.0 && tabs > 0.0) {
      const double xm = swx / sw;
      double sxy = 0.0, sxx = 0.0;
      for (int k : set.inBand) {
        if (k == 0) continue;
        const double x = (k < ns / 2 ? k : k - ns) / static_cast<double>(ns) - xm;
        const double w = std::abs(corr[k]);
        const double ph = std::arg(corr[k] * std::conj(total));
        sxy += w * x * ph;
        sxx += w * x * x;
      }
      if (sxx > 0.0) slope = sxy / sxx / (2.0 * kPi);
    }
    // Slope in cycles per unit of normalised range frequency.
    blk.value = (st.fc / st.fs) * slope;
  } catch (const std::bad_alloc&) {
    ORV_REPORT("wdar: out of memory", REPORT_ERROR);
    return STATUS_NO_MEMORY;
  }
  return STATUS_OK;
}
