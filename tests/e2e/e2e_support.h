#pragma once
// End-to-end harness: simulated ERS scenes, job files, the focuser driven
// as the host drives it (variables, command string, progress file), the
// product record, and the point-target analysis of sarpta.
#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include <chrono>
#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <map>
#include <regex>
#include <set>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "base/status.h"
#include "product/general_sar.h"
#include "sim/raw_scene.h"

namespace e2e {

namespace fs = std::filesystem;

inline const char* focuserPath() { return TESSIVOR_BINARY_DIR "/bin/stripmap_focuser"; }
inline const char* sarptaPath() { return TESSIVOR_BINARY_DIR "/bin/sarpta"; }
inline const char* resourcesDir() { return TESSIVOR_SOURCE_DIR "/resources/"; }

// A scratch folder for one test, removed at the end unless
// TESSIVOR_KEEP_E2E is set (to look at the products of a failed run).
class Folder {
 public:
  explicit Folder(const std::string& tag) {
    const auto* info = ::testing::UnitTest::GetInstance()->current_test_info();
    dir_ = fs::path(::testing::TempDir()) /
           ("tessivor_e2e_" + std::to_string(getpid()) + "_" + tag + "_" + info->name());
    fs::remove_all(dir_);
    fs::create_directories(dir_);
  }
  ~Folder() {
    if (std::getenv("TESSIVOR_KEEP_E2E")) return;
    std::error_code ec;
    fs::remove_all(dir_, ec);
  }
  Folder(const Folder&) = delete;
  Folder& operator=(const Folder&) = delete;
  // Path of a name inside the folder; the folder itself ends with '/'.
  std::string operator/(const std::string& name) const { return (dir_ / name).string(); }
  std::string str() const { return dir_.string() + "/"; }

 private:
  fs::path dir_;
};

inline std::string readText(const std::string& file) {
  std::ifstream in(file, std::ios::binary);
  std::stringstream s;
  s << in.rdbuf();
  return s.str();
}

inline void writeText(const std::string& file, const std::string& text) {
  std::ofstream(file, std::ios::binary) << text;
}

inline bool contains(const std::string& text, const std::string& part) {
  return text.find(part) != std::string::npos;
}

// ---- scenes -----------------------------------------------------------

// The orbit and radar of the example scene (an ERS-2 descending pass).
inline SceneDescription ersScene(int lines, int samples, double dopplerHz) {
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

// Files of a simulated scene.
struct SceneFiles {
  std::string root;    // simulation folder
  std::string image;   // DAT_01.001
  std::string leader;  // LEA_01.001
  std::string orbit;   // ODR arc
  std::string orbitArchive;  // folder holding ERS1/PRECISE/arclist
  std::string truth;
};

// Writes the scene under folder/sim; false with the message on failure.
inline bool simulate(const SceneDescription& scene, const std::string& folder, SceneFiles& files,
                     std::string& error) {
  try {
    const RawSceneSimulator sim(scene);
    files.root = folder + "sim";
    if (sim.writeErsScene(files.root, error) != 0) return false;
    files.image = sim.imagePath(files.root);
    files.leader = sim.leaderPath(files.root);
    files.orbit = sim.odrPath(files.root);
    files.orbitArchive = files.root + "/orbits";
    files.truth = files.root + "/truth.txt";
    return true;
  } catch (const std::exception& e) {
    error = e.what();
    return false;
  }
}

// ---- jobs -------------------------------------------------------------

// The 24 parameters of an ERS job ("NotOK" where nothing is given).
inline std::vector<std::string> ersJob(const SceneFiles& f, const std::string& outputRoot) {
  std::vector<std::string> p(24, "NotOK");
  p[0] = "ERS";
  p[1] = f.image;
  p[5] = outputRoot;
  p[6] = f.orbit;
  p[7] = f.leader;
  p[16] = "0";
  p[17] = "0";
  p[20] = "0";
  p[21] = "0";
  p[23] = "0";
  return p;
}

// A job file: an ignored first line, then one parameter a line.
inline void writeJob(const std::string& file, const std::vector<std::string>& parameters) {
  std::string text = "stripmap focusing job\n";
  for (const auto& p : parameters) text += p + "\n";
  writeText(file, text);
}

// ---- the executable as the host runs it -------------------------------

struct FocuserRun {
  int exitStatus = -1;  // as the parent sees it (low 8 bits)
  int errorCode = 0;    // full code from the _error file, 0 when there is none
  bool signalled = false;
  std::string log, trace, errorFile, stderrText;
  double seconds = 0.0;
};

// Host hook called every 50 ms while the focuser runs, with the text of
// the progress file.
using ProgressHook = std::function<void(const std::string& progressFile, const std::string& text)>;

inline FocuserRun runFocuser(const std::string& folder, const std::string& jobFile,
                      const ProgressHook& hook = nullptr, int timeoutSeconds = 1200) {
  const std::string progress = folder + "progress.txt";
  const std::string errFile = folder + "stderr.txt";
  const auto started = std::chrono::steady_clock::now();
  pid_t pid = fork();
  if (pid == 0) {
    for (const char* name : {"TESSIVOR_WORKING_DIR", "TESSIVOR_WORKING_FILE",
                             "TESSIVOR_CEOS_DES_FILES_DIR", "TESSIVOR_TRACING"})
      unsetenv(name);
    setenv("TESSIVOR_WORKING_DIR", folder.c_str(), 1);
    setenv("TESSIVOR_WORKING_FILE", progress.c_str(), 1);
    setenv("TESSIVOR_CEOS_DES_FILES_DIR", resourcesDir(), 1);
    setenv("TESSIVOR_TRACING", "ACTIVE", 1);
    if (chdir(folder.c_str()) != 0) _exit(126);
    int fd = open(errFile.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
    if (fd >= 0) {
      dup2(fd, STDERR_FILENO);
      dup2(fd, STDOUT_FILENO);
    }
    const std::string command = "main_focussing_stripmap#" + jobFile;
    execl(focuserPath(), "stripmap_focuser", command.c_str(), static_cast<char*>(nullptr));
    _exit(127);
  }
  FocuserRun run;
  int status = 0;
  for (;;) {
    const pid_t done = waitpid(pid, &status, WNOHANG);
    if (done == pid) break;
    if (done < 0) return run;
    if (hook) hook(progress, readText(progress));
    if (std::chrono::steady_clock::now() - started > std::chrono::seconds(timeoutSeconds)) {
      kill(pid, SIGKILL);
      waitpid(pid, &status, 0);
      ADD_FAILURE() << "focuser still running after " << timeoutSeconds << " s";
      break;
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(50));
  }
  run.seconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - started).count();
  if (WIFEXITED(status)) run.exitStatus = WEXITSTATUS(status);
  run.signalled = WIFSIGNALED(status);
  run.log = readText(folder + "Process.log");
  run.trace = readText(folder + "Process.trace");
  run.errorFile = readText(progress + "_error");
  run.stderrText = readText(errFile);
  std::smatch m;
  if (std::regex_search(run.errorFile, m, std::regex(R"(\[EC : (\d+)\])")))
    run.errorCode = std::stoi(m[1]);
  return run;
}

// ---- point-target analysis ---------------------------------------------

struct Metrics {
  double irw = 0.0, pslr = 0.0, islr = 0.0;
};
struct PtaTarget {
  bool found = false;
  double errorLine = 0.0, errorSample = 0.0, phaseError = 0.0;
  Metrics azimuth, range;
};
struct PtaReport {
  int exitStatus = -1;
  Metrics theoryAzimuth, theoryRange;
  std::vector<PtaTarget> targets;
  std::string table;
};

inline double jsonNumber(const std::string& object, const std::string& key) {
  std::smatch m;
  const std::regex re("\"" + key + R"(\"\s*:\s*(-?[0-9.eE+-]+|true|false))");
  if (!std::regex_search(object, m, re)) return std::nan("");
  const std::string v = m[1];
  if (v == "true") return 1.0;
  if (v == "false") return 0.0;
  return std::strtod(v.c_str(), nullptr);
}

// The metrics object named `axis` inside `object`.
inline Metrics jsonMetrics(const std::string& object, const std::string& axis) {
  Metrics m;
  const std::size_t at = object.find("\"" + axis + "\"");
  if (at == std::string::npos) return m;
  const std::string inner = object.substr(at, object.find('}', at) - at);
  m.irw = jsonNumber(inner, "irw_pixels");
  m.pslr = jsonNumber(inner, "pslr_db");
  m.islr = jsonNumber(inner, "islr_db");
  return m;
}

// Runs sarpta with the arguments (the JSON goes into folder/pta.json) and
// reads its results.
inline PtaReport runSarpta(const std::string& folder, const std::vector<std::string>& args) {
  std::string command = std::string(sarptaPath());
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
  // One object a line.
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
      // The target's own metrics follow its scalar fields.
      const std::size_t own = line.find("\"irw_range_m\"");
      t.azimuth = jsonMetrics(line.substr(own), "azimuth");
      t.range = jsonMetrics(line.substr(own), "range");
    }
    report.targets.push_back(t);
  }
  return report;
}

inline std::string number(double v) {
  char text[64];
  std::snprintf(text, sizeof text, "%.17g", v);
  return text;
}

// sarpta on a focused product, reading the time axes and spectral windows
// from the product's record, against the truth of the simulation.
inline PtaReport analyseProduct(const std::string& folder, const std::string& product,
                                const std::string& recordFile, const std::string& truth) {
  return runSarpta(folder, {"--raster", product, "--truth", truth, "--record", recordFile});
}

// Impulse-response shape of every target against the theory of the
// windows: IRW within 5 %, PSLR within 1 dB, on both axes.
inline void expectTheoreticalResponses(const PtaReport& pta, std::size_t targets) {
  ASSERT_EQ(pta.targets.size(), targets) << pta.table;
  for (std::size_t i = 0; i < pta.targets.size(); ++i) {
    const PtaTarget& t = pta.targets[i];
    SCOPED_TRACE("target " + std::to_string(i + 1) + "\n" + pta.table);
    ASSERT_TRUE(t.found);
    EXPECT_NEAR(t.azimuth.irw / pta.theoryAzimuth.irw, 1.0, 0.05);
    EXPECT_NEAR(t.range.irw / pta.theoryRange.irw, 1.0, 0.05);
    EXPECT_NEAR(t.azimuth.pslr, pta.theoryAzimuth.pslr, 1.0);
    EXPECT_NEAR(t.range.pslr, pta.theoryRange.pslr, 1.0);
  }
}

// Spread of angles around their circular mean, radians.
inline double phaseSpread(const std::vector<double>& phases) {
  double c = 0.0, s = 0.0;
  for (double p : phases) {
    c += std::cos(p);
    s += std::sin(p);
  }
  const double mean = std::atan2(s, c);
  double worst = 0.0;
  for (double p : phases) worst = std::max(worst, std::fabs(std::remainder(p - mean, 2.0 * M_PI)));
  return worst;
}

// Every found target within 0.1 pixel of its zero-Doppler truth on both
// axes, and the peak phases (less -4 pi R0 / lambda) within 5 degrees of
// one another.
inline void expectTargetsAtTruth(const PtaReport& pta) {
  std::vector<double> phases;
  for (const PtaTarget& t : pta.targets) {
    EXPECT_LT(std::fabs(t.errorLine), 0.1) << pta.table;
    EXPECT_LT(std::fabs(t.errorSample), 0.1) << pta.table;
    if (t.found) phases.push_back(t.phaseError);
  }
  EXPECT_LT(phaseSpread(phases) * 180.0 / M_PI, 5.0) << pta.table;
}

// Value of a key of the truth file's [Scene] section.
inline double truthValue(const std::string& truthFile, const std::string& key) {
  SimIni ini;
  std::string error;
  if (!ini.load(truthFile, error)) return std::nan("");
  return ini.getDouble("Scene", key, std::nan(""));
}

// Distance between two points on the ellipsoid, metres.
inline double groundDistance(double lat1, double lon1, double lat2, double lon2) {
  return norm(geodeticToEcef(lat1, lon1, 0.0) - geodeticToEcef(lat2, lon2, 0.0));
}

// Corners and centre of a focused product's record: each within 30 m of
// the ground point that its pixel shows (zero Doppler, on the ellipsoid).
inline void expectCornersOnTheGround(const GeneralSAR& record, const RawSceneSimulator& sim,
                                     const std::string& truthFile) {
  const ROI_Obj& roi = record.roi.roi;
  const double offset = truthValue(truthFile, "range_peak_offset_samples");
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
    EXPECT_LT(bestDistance, 30.0) << g->lat << " " << g->lon;
    matched.insert(best);
  }
  EXPECT_EQ(matched.size(), 4u);
  Corner centre{};
  ASSERT_TRUE(zeroDopplerPoint(sim.orbit(), 0.5 * (t0 + t1), 0.5 * (r0 + r1) * c / 2.0, 0.0, lookSign,
                               centre.lat, centre.lon));
  EXPECT_LT(groundDistance(corners.center.lat, corners.center.lon, centre.lat, centre.lon), 30.0);
}

}  // namespace e2e
