#include "point_targets.h"

#include <gtest/gtest.h>
#include <sys/wait.h>

#include <cmath>
#include <cstdlib>
#include <numbers>
#include <regex>
#include <set>
#include <sstream>

#include "files.h"
#include "product/general_sar.h"
#include "scenes.h"
#include "sim/sim_geometry.h"

namespace support {

namespace {

constexpr int kWindow = 64, kUpsample = 16;

double jsonNumber(const std::string& object, const std::string& key) {
  std::smatch m;
  const std::regex re("\"" + key + R"(\"\s*:\s*(-?[0-9.eE+-]+|true|false))");
  if (!std::regex_search(object, m, re)) return std::nan("");
  const std::string v = m[1];
  if (v == "true") return 1.0;
  if (v == "false") return 0.0;
  return std::strtod(v.c_str(), nullptr);
}

// The metrics object named `axis` inside `object`.
IrMetrics jsonMetrics(const std::string& object, const std::string& axis) {
  IrMetrics m;
  const std::size_t at = object.find("\"" + axis + "\"");
  if (at == std::string::npos) return m;
  const std::string inner = object.substr(at, object.find('}', at) - at);
  m.irwPixels = jsonNumber(inner, "irw_pixels");
  m.pslrDb = jsonNumber(inner, "pslr_db");
  m.islrDb = jsonNumber(inner, "islr_db");
  return m;
}

}  // namespace

PtaReport runSarpta(const std::string& folder, const std::vector<std::string>& args) {
  std::string command = std::string(binDir()) + "sarpta";
  for (const auto& a : args) command += " '" + a + "'";
  const std::string json = folder + "pta.json";
  command += " --json '" + json + "' > '" + folder + "pta.txt' 2>&1";
  PtaReport report;
  const int status = std::system(command.c_str());
  report.exitStatus = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  report.table = readText(folder + "pta.txt");
  const std::string text = readText(json);
  const std::size_t theory = text.find("\"theory\"");
  const std::size_t targets = text.find("\"targets\"");
  if (theory == std::string::npos || targets == std::string::npos) return report;
  const std::string head = text.substr(theory, targets - theory);
  report.theoryAzimuth = jsonMetrics(head, "azimuth");
  report.theoryRange = jsonMetrics(head, "range");
  // One object a line; the target's own metrics follow its scalar fields.
  std::istringstream lines(text.substr(targets));
  std::string line;
  while (std::getline(lines, line)) {
    if (!contains(line, "\"index\"")) continue;
    PtaTarget t;
    t.found = jsonNumber(line, "found") == 1.0;
    if (t.found) {
      t.errorLine = jsonNumber(line, "error_line");
      t.errorSample = jsonNumber(line, "error_sample");
      t.phaseError = jsonNumber(line, "phase_error_rad");
      const std::string own = line.substr(line.find("\"irw_range_m\""));
      t.azimuth = jsonMetrics(own, "azimuth");
      t.range = jsonMetrics(own, "range");
      t.azimuthTheory = jsonMetrics(own, "azimuth_theory");
    }
    report.targets.push_back(t);
  }
  return report;
}

PtaReport analyseProduct(const std::string& folder, const std::string& product, const std::string& record,
                         const std::string& truth) {
  return runSarpta(folder, {"--raster", product, "--truth", truth, "--record", record});
}

void expectTheoreticalResponses(const PtaReport& pta, std::size_t targets) {
  ASSERT_EQ(pta.targets.size(), targets) << pta.table;
  for (std::size_t i = 0; i < pta.targets.size(); ++i) {
    const PtaTarget& t = pta.targets[i];
    SCOPED_TRACE("target " + std::to_string(i + 1) + "\n" + pta.table);
    ASSERT_TRUE(t.found);
    const IrMetrics& azimuth = t.azimuthTheory.irwPixels > 0.0 ? t.azimuthTheory : pta.theoryAzimuth;
    EXPECT_NEAR(t.azimuth.irwPixels / azimuth.irwPixels, 1.0, bars::kIrwRatio);
    EXPECT_NEAR(t.range.irwPixels / pta.theoryRange.irwPixels, 1.0, bars::kIrwRatio);
    EXPECT_NEAR(t.azimuth.pslrDb, azimuth.pslrDb, bars::kPslrDb);
    EXPECT_NEAR(t.range.pslrDb, pta.theoryRange.pslrDb, bars::kPslrDb);
  }
}

void expectTruthPositions(const PtaReport& pta, double lineShift, bool phases) {
  std::vector<double> errors;
  for (const PtaTarget& t : pta.targets) {
    EXPECT_NEAR(t.errorLine, lineShift, bars::kProductPixels) << pta.table;
    EXPECT_NEAR(t.errorSample, 0.0, bars::kProductPixels) << pta.table;
    if (t.found) errors.push_back(t.phaseError);
  }
  if (phases) {
    EXPECT_LT(phaseSpread(errors) * 180.0 / std::numbers::pi, bars::kPhaseDeg) << pta.table;
  }
}

double groundDistance(double lat1, double lon1, double lat2, double lon2) {
  return norm(geodeticToEcef(lat1, lon1, 0.0) - geodeticToEcef(lat2, lon2, 0.0));
}

void expectCornersOnTheGround(const GeneralSAR& record, const RawSceneSimulator& sim, const std::string& truthFile) {
  const ROI_Obj& roi = record.roi.roi;
  // The record's first range time is that of the compressed peak; the
  // ground a pixel shows lies at the two-way delay before the peak offset.
  const double offset = truthValue(truthFile, "range_peak_offset_samples");
  ASSERT_FALSE(std::isnan(offset)) << "no range peak offset in " << truthFile;
  const double c = 299792458.0;
  const double t0 = roi.SlowStartTime, t1 = t0 + roi.SlowTimeDelta * roi.Lines;
  const double r0 = roi.FastStartTime - offset * roi.FastTimeDelta;
  const double r1 = r0 + roi.FastTimeDelta * roi.Samples;
  const int lookSign = sim.scene().lookSign;
  struct Corner {
    double lat, lon;
  };
  std::vector<Corner> truth;
  for (double t : {t0, t1})
    for (double r : {r0, r1}) {
      Corner k{};
      ASSERT_TRUE(zeroDopplerPoint(sim.orbit(), t, r * c / 2.0, 0.0, lookSign, k.lat, k.lon));
      truth.push_back(k);
    }
  const geoCoords_Obj& corners = record.geoCoords;
  std::set<int> matched;
  for (const geopoint* g : {&corners.NW, &corners.NE, &corners.SW, &corners.SE}) {
    int best = -1;
    double bestDistance = 1e30;
    for (int k = 0; k < 4; ++k) {
      const double d = groundDistance(g->lat, g->lon, truth[k].lat, truth[k].lon);
      if (d < bestDistance) bestDistance = d, best = k;
    }
    EXPECT_LT(bestDistance, bars::kCornerMetres) << g->lat << " " << g->lon;
    matched.insert(best);
  }
  EXPECT_EQ(matched.size(), 4u);
  Corner centre{};
  ASSERT_TRUE(zeroDopplerPoint(sim.orbit(), 0.5 * (t0 + t1), 0.5 * (r0 + r1) * c / 2.0, 0.0, lookSign, centre.lat,
                               centre.lon));
  EXPECT_LT(groundDistance(corners.center.lat, corners.center.lon, centre.lat, centre.lon), bars::kCornerMetres);
}

double phaseSpread(const std::vector<double>& phases) {
  double c = 0.0, s = 0.0;
  for (double p : phases) {
    c += std::cos(p);
    s += std::sin(p);
  }
  const double mean = std::atan2(s, c);
  double worst = 0.0;
  for (double p : phases) worst = std::max(worst, std::fabs(std::remainder(p - mean, 2.0 * std::numbers::pi)));
  return worst;
}

PtaResult measureTarget(const fcomplex* image, int rows, int cols, double row, double col, int search) {
  int br = static_cast<int>(std::lround(row)), bc = static_cast<int>(std::lround(col));
  float best = -1.0f;
  for (int r = br - search, r0 = br, c0 = bc; r <= r0 + search; ++r)
    for (int c = c0 - search; c <= c0 + search; ++c) {
      if (r < 0 || r >= rows || c < 0 || c >= cols) continue;
      const float v = std::norm(image[static_cast<std::size_t>(r) * cols + c]);
      if (v > best) {
        best = v;
        br = r;
        bc = c;
      }
    }
  // The window centred on the peak, so the analysis finds this target.
  const int r0 = br - kWindow / 2, c0 = bc - kWindow / 2;
  std::vector<cdouble> win(static_cast<std::size_t>(kWindow) * kWindow, cdouble(0.0, 0.0));
  for (int r = 0; r < kWindow; ++r)
    for (int c = 0; c < kWindow; ++c)
      if (r0 + r >= 0 && r0 + r < rows && c0 + c >= 0 && c0 + c < cols)
        win[static_cast<std::size_t>(r) * kWindow + c] =
            cdouble(image[static_cast<std::size_t>(r0 + r) * cols + c0 + c]);
  PtaOptions opt;
  opt.window = kWindow;
  opt.upsample = kUpsample;
  PtaResult m = analyseWindow(win, kWindow, kWindow, 0.0, opt);
  m.peakLine += r0;
  m.peakSample += c0;
  m.errorLine = m.peakLine - row;
  m.errorSample = m.peakSample - col;
  return m;
}

IrMetrics theoryOfWeight(const std::function<double(double)>& w) {
  const int nf = 4096;
  std::vector<double> wu(nf), u(nf);
  for (int q = 0; q < nf; ++q) {
    u[q] = -0.5 + (q + 0.5) / nf;
    wu[q] = w(u[q]);
  }
  const int n = kWindow * kUpsample;
  std::vector<double> power(n);
  for (int i = 0; i < n; ++i) {
    const double x = static_cast<double>(i - n / 2) / kUpsample;
    std::complex<double> h = 0.0;
    for (int q = 0; q < nf; ++q)
      if (wu[q] != 0.0) h += wu[q] * std::polar(1.0, 2.0 * std::numbers::pi * u[q] * x);
    power[i] = std::norm(h);
  }
  return profileMetrics(power, 1.0 / kUpsample, n / 2);
}

void expectTarget(const PtaResult& m, double row, double col, const IrMetrics& azimuth, const IrMetrics& range) {
  SCOPED_TRACE(testing::Message() << "target at row " << row << " col " << col);
  ASSERT_TRUE(m.found);
  EXPECT_NEAR(m.peakLine, row, bars::kPositionPixels);
  EXPECT_NEAR(m.peakSample, col, bars::kPositionPixels);
  EXPECT_NEAR(m.azimuth.irwPixels / azimuth.irwPixels, 1.0, bars::kIrwRatio);
  EXPECT_NEAR(m.range.irwPixels / range.irwPixels, 1.0, bars::kIrwRatio);
  EXPECT_NEAR(m.azimuth.pslrDb, azimuth.pslrDb, bars::kPslrDb);
  EXPECT_NEAR(m.range.pslrDb, range.pslrDb, bars::kPslrDb);
  EXPECT_NEAR(m.azimuth.islrDb, azimuth.islrDb, bars::kIslrDb);
  EXPECT_NEAR(m.range.islrDb, range.islrDb, bars::kIslrDb);
}

}  // namespace support
