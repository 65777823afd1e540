#include "core/azimuth_block.h"

#include <gtest/gtest.h>

#include <cmath>
#include <complex>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include <unistd.h>

#include "azimuth_test_scene.h"
#include "core/azimuth_focus.h"
#include "core/fft.h"

#ifdef _OPENMP
#include <omp.h>
#endif

namespace {

using azimuth_scene::Geometry;
using azimuth_scene::kC;
using azimuth_scene::kPi;

AzimuthBlockPar basePar() {
  AzimuthBlockPar p;
  p.fc = 5.3e9;
  p.frg = 18.96e6;
  p.prf = 1680.0;
  p.Veq = 7000.0;
  p.lines = 8;
  p.samples = 1000;
  return p;
}

std::vector<double> gridHz(const AzimuthBlockPar& p, std::vector<double>* dk = nullptr) {
  std::vector<double> kx(p.lines), kx2(p.lines), d(p.lines);
  AzimuthGrid(p, kx.data(), kx2.data(), d.data());
  std::vector<double> f;
  for (int i = 0; i < p.lines; ++i) {
    EXPECT_DOUBLE_EQ(kx2[i], kx[i] * kx[i]);
    f.push_back(kx[i] * p.Veq / (2.0 * kPi));
  }
  if (dk) *dk = d;
  return f;
}

TEST(AzimuthGrid, RowsWrapModuloPrfAroundTheCentroid) {
  AzimuthBlockPar p = basePar();
  p.dc = 1000.0;  // band 160 .. 1840 Hz
  std::vector<double> f = gridHz(p);
  const double up[] = {1680, 210, 420, 630, 840, 1050, 1260, 1470};
  for (int i = 0; i < 8; ++i) EXPECT_NEAR(f[i], up[i], 1e-9) << i;

  p.dc = -1000.0;  // band -1840 .. -160 Hz
  f = gridHz(p);
  const double down[] = {-1680, -1470, -1260, -1050, -840, -630, -420, -210};
  for (int i = 0; i < 8; ++i) EXPECT_NEAR(f[i], down[i], 1e-9) << i;

  p.dc = 0.0;  // band -840 .. 840: row 0 is kx = 0, row 4 wraps to -840
  std::vector<double> dk;
  f = gridHz(p, &dk);
  EXPECT_EQ(f[0], 0.0);
  EXPECT_NEAR(f[4], -840.0, 1e-9);
  EXPECT_NEAR(f[5], -630.0, 1e-9);
  EXPECT_EQ(dk[0], 0.0);
  // dk is the range wavenumber offset that maps to the reference kz.
  const double k0 = 4.0 * kPi * p.fc / kC, kx = -840.0 * 2.0 * kPi / p.Veq;
  EXPECT_NEAR(dk[4], k0 - std::sqrt(kx * kx + k0 * k0), 1e-12);
  EXPECT_LT(dk[4], 0.0);
}

TEST(WindowPars, FractionsMessagesAndReset) {
  AzimuthBlockPar p = basePar();
  p.azw = 0.6;
  p.rgw = 0.75;
  p.azlook = 1344.0;
  p.aztrans = 336.0;
  p.rglook = 15.55e6;
  p.rgtrans = 2e6;
  double ap, a, b, c, d;
  testing::internal::CaptureStderr();
  WindowPars(p, ap, a, b, c, d);
  EXPECT_EQ(testing::internal::GetCapturedStderr(), "");
  EXPECT_DOUBLE_EQ(a, 0.3);
  EXPECT_DOUBLE_EQ(b, 0.1);
  EXPECT_DOUBLE_EQ(c, 13.55e6 / 2.0 / 18.96e6);
  EXPECT_DOUBLE_EQ(d, 1e6 / 18.96e6);
  // At zero centroid the aperture is about the angle the PRF spans.
  EXPECT_NEAR(ap, p.prf * (kC / p.fc) / (2.0 * p.Veq), 1e-5 * ap);
  EXPECT_EQ(p.azw, 0.6);
  EXPECT_EQ(p.rgw, 0.75);

  p.azlook = 2000.0;  // wider than the PRF
  testing::internal::CaptureStderr();
  WindowPars(p, ap, a, b, c, d);
  EXPECT_EQ(testing::internal::GetCapturedStderr(),
            "Wrong azimuth hamming window parameters: no window applied.\n");
  EXPECT_EQ(p.azw, 0.0);
  EXPECT_EQ(p.rgw, 0.75);

  p.rglook = 20e6;  // wider than the sampling rate
  testing::internal::CaptureStderr();
  WindowPars(p, ap, a, b, c, d);
  EXPECT_EQ(testing::internal::GetCapturedStderr(),
            "Wrong azimuth hamming window parameters: no window applied.\n"
            "Wrong range hamming window parameters: no window applied. \n");
  EXPECT_EQ(p.rgw, 0.0);
}

TEST(WindowTerms, RaisedCosineAndPatternTerm) {
  EXPECT_EQ(wk_raised_cosine(-1.0, 2.0, 0.5), 1.0);
  EXPECT_EQ(wk_raised_cosine(0.0, 2.0, 0.5), 1.0);
  EXPECT_NEAR(wk_raised_cosine(1.0, 2.0, 0.5), 0.5, 1e-15);
  EXPECT_NEAR(wk_raised_cosine(0.5, 1.0, 0.08), 0.08, 1e-15);
  EXPECT_NEAR(wk_raised_cosine(0.25, 1.0, 0.54), 0.54 + 0.46 * std::cos(kPi / 4), 1e-15);
  EXPECT_EQ(wk_raised_cosine(2.0, 2.0, 0.5), 0.0);
  EXPECT_EQ(wk_raised_cosine(3.0, 2.0, 0.5), 0.0);

  // Beam centre: sc = 1 plus the two aliases one PRF away.
  const double k = 222.0, L = 10.0 / 0.0566, Bx = 1.5, sq = 0.01;
  const double kxc = k * std::sin(sq);
  auto s = [](double u) { return std::sin(kPi * u) / (kPi * u); };
  const double sm = s(L * std::sin(sq - std::asin((kxc - Bx) / k)));
  const double sp = s(L * std::sin(sq - std::asin((kxc + Bx) / k)));
  EXPECT_NEAR(wk_pattern_term(L, sq, k, kxc, Bx), 1.0 + std::pow(sm, 4) + std::pow(sp, 4), 1e-12);
  // First null of the one-way pattern, aliases far away.
  const double kxNull = k * std::sin(sq - std::asin(1.0 / L));
  EXPECT_LT(wk_pattern_term(L, sq, k, kxNull, 10.0), 1e-6);
  EXPECT_NEAR(wk_pattern_term(L, sq, k, kxNull, Bx),
              std::pow(s(L * std::sin(sq - std::asin((kxNull - Bx) / k))), 4) +
                  std::pow(s(L * std::sin(sq - std::asin((kxNull + Bx) / k))), 4),
              1e-9);
}

TEST(RngShift, RampDivisorTailAndInPlace) {
  const std::vector<fcomplex> in = {{1.0f, 0.0f}, {0.0f, 1.0f}, {2.0f, -1.0f}};
  std::vector<fcomplex> out(5, fcomplex(7.0f, 7.0f));
  RngShift(in.data(), 3, 0.5, 2.0, out.data(), 5, 0.25, 2.0);
  for (int i = 0; i < 3; ++i) {
    const std::complex<double> e =
        std::complex<double>(in[i]) * std::polar(1.0, i * 1.0 + 0.5) / 2.0;
    EXPECT_NEAR(out[i].real(), e.real(), 1e-6) << i;
    EXPECT_NEAR(out[i].imag(), e.imag(), 1e-6) << i;
  }
  EXPECT_EQ(out[3], fcomplex(0.0f, 0.0f));
  EXPECT_EQ(out[4], fcomplex(0.0f, 0.0f));
  std::vector<fcomplex> same = in;
  same.resize(4, fcomplex(3.0f, 3.0f));
  RngShift(same.data(), 3, 0.5, 2.0, same.data(), 4, 0.25, 2.0);
  for (int i = 0; i < 4; ++i) EXPECT_EQ(same[i], out[i]) << i;
}

TEST(OutImagePar, GridSizesAndSquintLimit) {
  AzimuthBlockPar p = basePar();
  p.dc = 300.0;
  p.pad = 0.4;
  int M = 0, padded = 0, n = 0;
  double spacing = 0.0;
  const double dr = kC / (2.0 * p.frg);
  ASSERT_EQ(OutImagePar(p, M, spacing, padded, n), 0);
  EXPECT_GE(spacing, dr);
  EXPECT_NEAR(spacing, dr, 1e-3 * dr);  // Nyquist spacing about dr at small squint
  EXPECT_LE(n, p.samples);
  EXPECT_GE(n, p.samples - 2);
  EXPECT_EQ(M, genpow(n, 1));
  EXPECT_EQ(padded, genpow(1400, 1));

  p.scale = 2.0;  // coarser output grid
  ASSERT_EQ(OutImagePar(p, M, spacing, padded, n), 0);
  EXPECT_DOUBLE_EQ(spacing, 2.0 * dr);
  EXPECT_EQ(n, static_cast<int>(std::ceil(std::cos(std::asin(kC / p.fc * p.dc / 2.0 / p.Veq)) *
                                          p.samples / 2.0)));
  p.interp = 1;  // zoom length from the spectral support, padding ignored
  ASSERT_EQ(OutImagePar(p, M, spacing, padded, n), 0);
  EXPECT_NEAR(padded, p.samples, 0.01 * p.samples);

  p.dc = 3e5;  // beyond the geometric limit
  testing::internal::CaptureStderr();
  EXPECT_EQ(OutImagePar(p, M, spacing, padded, n), 1);
  EXPECT_EQ(testing::internal::GetCapturedStderr(),
            "Squint angle too large: reached geometrical limit.");
}

TEST(MyComputeEqPar, RecoversTheGeometryFromTheRateModel) {
  Geometry g;
  g.dc = 500.0;
  AzimuthBlockPar p = basePar();
  p.samples = 512;
  p.dc = g.dc;
  p.t0 = g.fastStart();
  // Quadratic through the rates at near, mid and far range of the block.
  p.trg0 = p.t0;
  const double T = p.samples / p.frg;
  const double r0 = g.rateAt(p.t0), r1 = g.rateAt(p.t0 + T / 2), r2 = g.rateAt(p.t0 + T);
  p.fr0 = r0;
  p.fr2 = (r2 - 2.0 * r1 + r0) / (T * T / 2.0);
  p.fr1 = (r1 - r0) / (T / 2.0) - p.fr2 * T / 2.0;
  p.interp = 1;
  ASSERT_EQ(MyComputeEqPar(p), 0);
  EXPECT_NEAR(p.Veq, g.V, 1e-6);
  const double cs = std::cos(g.squint());
  EXPECT_NEAR(p.Req, cs * g.nearRange, 1e-3);
  p.interp = 0;  // reference moves to mid swath
  ASSERT_EQ(MyComputeEqPar(p), 0);
  EXPECT_NEAR(p.Req, cs * (g.nearRange + 256 * kC / (2.0 * p.frg)), 1e-3);

  p.fr1 = p.fr2 = 0.0;  // no range variation: geometry undefined
  EXPECT_EQ(MyComputeEqPar(p), 1);
}

TEST(ShiftDistances, AutomaticAndExplicitShifts) {
  AzimuthBlockPar p = basePar();
  p.dc = 800.0;
  p.Req = 850e3;
  p.samples = 256;
  const double k0 = 4.0 * kPi * p.fc / kC, kx = 2.0 * kPi * p.dc / p.Veq;
  const double kz = std::sqrt(k0 * k0 - kx * kx), dr = kC / (2.0 * p.frg);
  double az, rg;
  p.azshift = p.lines;  // automatic
  p.rgshift = p.samples;
  ShiftDistances(p, az, rg);
  EXPECT_NEAR(az, kx * p.Req / kz, 1e-9);
  EXPECT_NEAR(rg, (k0 / kz - 1.0) * p.Req + p.Req + dr * 128 * (kz / k0 - 1.0), 1e-6);
  p.interp = 7;
  ShiftDistances(p, az, rg);
  EXPECT_NEAR(az, kx / kz * (128 * dr * kz / k0 + p.Req), 1e-9);
  EXPECT_NEAR(rg, k0 / kz * p.Req, 1e-6);
  p.azshift = 0.01;
  p.rgshift = 1e-7;
  ShiftDistances(p, az, rg);
  EXPECT_DOUBLE_EQ(az, p.Veq * 0.01);
  EXPECT_NEAR(rg, 1e-7 * kC / 2.0 + p.Req, 1e-6);
  p.dcref = 0.0;
  p.dc = 0.0;
  p.azshift = p.lines;
  ShiftDistances(p, az, rg);
  EXPECT_EQ(az, 0.0);
}

TEST(AzimuthFocusShifts, AutomaticExplicitAndRest) {
  AzimuthFocusConf c;
  const int lines = 6000, samples = 5000;
  const double sq = 0.003, Req = 850e3, Veq = 7100.0, prf = 1680.0, frg = 18.96e6;
  double az, rg;
  c.ApplyAzShift = lines;  // exactly the lines: automatic, no rest
  c.ApplyRgShift = samples;
  azimuth_focus_shifts(c, lines, samples, sq, Req, Veq, prf, frg, az, rg);
  EXPECT_DOUBLE_EQ(az, std::tan(sq) * Req / Veq);
  EXPECT_DOUBLE_EQ(rg, 2.0 * (1.0 / std::cos(sq) - 1.0) * Req / kC);
  c.PerformInterpolation = 7;  // reference at mid swath
  azimuth_focus_shifts(c, lines, samples, sq, Req, Veq, prf, frg, az, rg);
  EXPECT_DOUBLE_EQ(az, std::tan(sq) * (Req + std::cos(sq) * 2500 * 149896229.0 / frg) / Veq);
  c.PerformInterpolation = 0;
  c.ApplyAzShift = lines + 10;  // automatic plus 10 lines
  c.ApplyRgShift = -(samples + 4);
  azimuth_focus_shifts(c, lines, samples, sq, Req, Veq, prf, frg, az, rg);
  EXPECT_NEAR(az, std::tan(sq) * Req / Veq + 10.0 / prf, 1e-15);
  EXPECT_NEAR(rg, 2.0 * (1.0 / std::cos(sq) - 1.0) * Req / kC - 4.0 / frg, 1e-18);
  c.ApplyAzShift = -(lines + 10);
  azimuth_focus_shifts(c, lines, samples, 0.0, Req, Veq, prf, frg, az, rg);
  EXPECT_NEAR(az, -10.0 / prf, 1e-15);  // zero centroid: no automatic part
  c.ApplyAzShift = lines - 1;  // below the lines: seconds as given
  c.ApplyRgShift = 3e-8;
  azimuth_focus_shifts(c, lines, samples, sq, Req, Veq, prf, frg, az, rg);
  EXPECT_EQ(az, lines - 1.0);
  EXPECT_EQ(rg, 3e-8);
}

TEST(AzimuthBlockPlan, StepsLastBlockAndProgress) {
  AzimuthBlockPlan p;
  ASSERT_EQ(azimuth_block_plan(10000, 4096, 700, p), 0);
  EXPECT_EQ(p.overlap, 1400);
  EXPECT_EQ(p.step, 2696);
  EXPECT_EQ(p.last, 3);  // last block 10000 - 3 * 2696 = 1912 lines
  EXPECT_EQ(p.progressTotal, 4);
  ASSERT_EQ(azimuth_block_plan(6792, 4096, 700, p), 0);
  EXPECT_EQ(p.last, 2);  // last block of exactly the overlap: skipped
  EXPECT_EQ(p.progressTotal, 2);
  EXPECT_EQ(azimuth_block_plan(6792, 1400, 700, p), 1);
}

// A small two-target scene: 2400 lines in blocks of 2048 (the last block
// 1752 lines), 256 samples in sub-blocks of 128.
struct SmallScene {
  Geometry g;
  AzimuthFocusFiles files;
  AzimuthFocusScene scene;
  AzimuthFocusConf conf;
  std::vector<fcomplex> raw;
  SmallScene() {
    g.samples = 256;
    g.lines = 2400;
    g.dc = 250.0;
    files.frg_hz = g.frg;
    files.fc_hz = g.fc;
    files.prf_hz = g.prf;
    files.FastStartTime = g.fastStart();
    files.bandwidth_hz = g.B;
    scene.samples = g.samples;
    scene.lines = g.lines;
    const double tref = g.fastStart() + 128 / g.frg;
    scene.polyDC[0] = g.dc;
    scene.polyDC[7] = tref;
    g.ratePoly(tref, scene.polyFR[0], scene.polyFR[1], scene.polyFR[4]);
    scene.polyFR[7] = tref;
    conf.AntennaLength = g.La;
    conf.WhiteningFlag = 1;
    conf.AzimuthWindowHammingParameter = 0.54;
    conf.AzimuthLookBandwidth = 0.8 * g.prf;
    conf.AzimuthTransitionBandwidth = 0.8 * g.prf;
    conf.SamplesInBlock = 128;
    conf.LinesInBlock = 2048;
    conf.RangeOverlap = 16;
    conf.AzimuthOverlap = 700;
    conf.ApplyAzShift = g.lines;
    const double slant = g.nearRange + 100 * kC / (2.0 * g.frg);
    raw = azimuth_scene::simulate(g, {{0.9, slant, 1.0}, {1.2, slant + 700.0, 0.5}});
  }
};

std::string tempDir(const char* name) {
  const std::string d = testing::TempDir() + "azimuth_" + name + "_" + std::to_string(::getpid());
  std::filesystem::create_directories(d);
  return d;
}

TEST(AzimuthFoc, FileAndInCoreFormsAgreeAndThreadsDoNotChangeBits) {
  SmallScene s;
  const std::string dir = tempDir("forms");
  s.files.input = dir + "/in.rgfoc";
  s.files.output = dir + "/out";
  {
    std::ofstream f(s.files.input, std::ios::binary);
    f.write(reinterpret_cast<const char*>(s.raw.data()),
            static_cast<std::streamsize>(s.raw.size() * sizeof(fcomplex)));
  }
#ifdef _OPENMP
  const int threads = omp_get_max_threads();
  omp_set_num_threads(1);
#endif
  AzimuthFocusScene fileScene = s.scene;
  ASSERT_EQ(azimuthfoc(s.files, fileScene, s.conf), 0);
#ifdef _OPENMP
  omp_set_num_threads(std::max(2, threads));
#endif
  AzimuthFocusScene coreScene = s.scene;
  std::vector<fcomplex> buf = s.raw;
  coreScene.inCore = 1;
  coreScene.buffer = buf.data();
  ASSERT_EQ(azimuthfoc(s.files, coreScene, s.conf), 0);
#ifdef _OPENMP
  omp_set_num_threads(threads);
#endif
  EXPECT_EQ(fileScene.outLines, 1000);
  EXPECT_EQ(fileScene.outSamples, 224);
  EXPECT_EQ(coreScene.outLines, 1000);
  EXPECT_DOUBLE_EQ(fileScene.firstLineTime, coreScene.firstLineTime);
  // ApplyRgShift 0: no range shift.
  EXPECT_DOUBLE_EQ(fileScene.firstSampleTime, 16 / s.g.frg + s.g.fastStart());
  EXPECT_EQ(fileScene.polyDCOut[0], 250.0);
  EXPECT_EQ(fileScene.polyFROut[7], s.scene.polyFR[7]);
  const std::size_t n = static_cast<std::size_t>(1000) * 224;
  std::vector<fcomplex> fromFile(n);
  {
    std::ifstream f(s.files.output, std::ios::binary | std::ios::ate);
    ASSERT_EQ(static_cast<std::size_t>(f.tellg()), n * sizeof(fcomplex));
    f.seekg(0);
    f.read(reinterpret_cast<char*>(fromFile.data()), static_cast<std::streamsize>(n * 8));
  }
  EXPECT_EQ(std::memcmp(fromFile.data(), buf.data(), n * sizeof(fcomplex)), 0);
  // Both targets are focused: their peaks stand far above the clutter-free
  // background.
  float peak = 0.0f;
  for (std::size_t i = 0; i < n; ++i) peak = std::max(peak, std::norm(fromFile[i]));
  EXPECT_GT(peak, 1.0f);

  // A truncated input file fails reading; a missing one is not opened.
  std::filesystem::resize_file(s.files.input, s.raw.size() * sizeof(fcomplex) / 2);
  AzimuthFocusScene bad = s.scene;
  EXPECT_EQ(azimuthfoc(s.files, bad, s.conf), 4);
  s.files.input = dir + "/absent";
  EXPECT_EQ(azimuthfoc(s.files, bad, s.conf), 9);
  std::filesystem::remove_all(dir);
}

TEST(AzimuthFoc, SceneShorterThanTheOverlapGivesNoRows) {
  SmallScene s;
  s.scene.lines = 1000;
  s.conf.ApplyAzShift = 0.0;
  s.scene.inCore = 1;
  s.scene.buffer = s.raw.data();
  ASSERT_EQ(azimuthfoc(s.files, s.scene, s.conf), 0);
  EXPECT_EQ(s.scene.outLines, 0);
  EXPECT_DOUBLE_EQ(s.scene.firstLineTime, 700 / s.g.prf);
  s.conf.SamplesInBlock = 32;  // sub-block equal to the range overlap
  EXPECT_EQ(azimuthfoc(s.files, s.scene, s.conf), 10);
}

}  // namespace
