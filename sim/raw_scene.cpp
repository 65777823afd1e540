#include "sim/raw_scene.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>

#include "base/constants.h"
#include "sim/ers_ceos_writer.h"
#include "sim/sim_fft.h"

namespace {

constexpr double kC = consts::kSpeedOfLight;
constexpr double kPi = consts::kPi;
constexpr int kRangeTapHalf = 7;
constexpr int kAzimuthTapHalf = 6;

std::string trim(const std::string& s) {
  std::size_t a = 0, b = s.size();
  while (a < b && (s[a] == ' ' || s[a] == '\t' || s[a] == '\r')) ++a;
  while (b > a && (s[b - 1] == ' ' || s[b - 1] == '\t' || s[b - 1] == '\r')) --b;
  return s.substr(a, b - a);
}

// The value as the leader's text field gives it back.
double roundTrip(const char* format, double v) {
  char buf[64];
  std::snprintf(buf, sizeof buf, format, v);
  return std::strtod(buf, nullptr);
}

double wrapPhase(double p) { return std::remainder(p, 2.0 * kPi); }

// Counter-based generator: the value of one (stream, row, sample) cell.
inline std::uint64_t mix(std::uint64_t x) {
  x += 0x9E3779B97F4A7C15ULL;
  x = (x ^ (x >> 30)) * 0xBF58476D1CE4E5B9ULL;
  x = (x ^ (x >> 27)) * 0x94D049BB133111EBULL;
  return x ^ (x >> 31);
}

inline fcomplex gaussCell(std::uint64_t seed, std::uint64_t stream, std::int64_t row, std::int64_t sample) {
  const std::uint64_t h = mix(mix(seed * 0x100000001B3ULL + stream) ^ mix(static_cast<std::uint64_t>(row) * 0x2545F4914F6CDD1DULL +
                                                                       static_cast<std::uint64_t>(sample)));
  const float u1 = (static_cast<float>(h >> 40) + 0.5f) * (1.0f / 16777216.0f);
  const float u2 = (static_cast<float>(h & 0xFFFFFFULL) + 0.5f) * (1.0f / 16777216.0f);
  const float r = std::sqrt(-2.0f * std::log(u1));
  const float th = 6.2831853f * u2;
  return {r * std::cos(th), r * std::sin(th)};
}

double sinc(double x) { return x == 0.0 ? 1.0 : std::sin(kPi * x) / (kPi * x); }

std::vector<int> parseIntList(const std::string& v) {
  std::vector<int> out;
  std::istringstream is(v);
  std::string tok;
  while (is >> tok) {
    const auto dash = tok.find('-', 1);
    if (dash != std::string::npos) {
      const int a = std::stoi(tok.substr(0, dash)), b = std::stoi(tok.substr(dash + 1));
      for (int k = a; k <= b; ++k) out.push_back(k);
    } else {
      out.push_back(std::stoi(tok));
    }
  }
  return out;
}

bool writeFile(const std::string& path, const char* data, std::size_t n, std::string& error) {
  std::ofstream f(path, std::ios::binary | std::ios::trunc);
  if (!f || !f.write(data, static_cast<std::streamsize>(n))) {
    error = "cannot write " + path;
    return false;
  }
  return true;
}

}  // namespace

double ersSwstSeconds(int code) { return code * 2.10943e-07 + 0.005357529 - 6.627e-06; }

// ------------------------------------------------------------------ SimIni

bool SimIni::loadText(const std::string& text, std::string& error) {
  entries.clear();
  std::istringstream is(text);
  std::string line, section;
  int number = 0;
  while (std::getline(is, line)) {
    ++number;
    const auto hash = line.find_first_of("#;");
    if (hash != std::string::npos) line.erase(hash);
    line = trim(line);
    if (line.empty()) continue;
    if (line.front() == '[') {
      if (line.back() != ']') {
        error = "line " + std::to_string(number) + ": section name without ']'";
        return false;
      }
      section = trim(line.substr(1, line.size() - 2));
      continue;
    }
    const auto eq = line.find('=');
    if (eq == std::string::npos) {
      error = "line " + std::to_string(number) + ": expected key = value";
      return false;
    }
    entries.push_back({section, trim(line.substr(0, eq)), trim(line.substr(eq + 1))});
  }
  return true;
}

bool SimIni::load(const std::string& path, std::string& error) {
  std::ifstream f(path);
  if (!f) {
    error = "cannot open " + path;
    return false;
  }
  std::stringstream ss;
  ss << f.rdbuf();
  if (!loadText(ss.str(), error)) {
    error = path + ": " + error;
    return false;
  }
  return true;
}

const std::string* SimIni::find(const std::string& section, const std::string& key) const {
  const std::string* found = nullptr;
  for (const Entry& e : entries)
    if (e.section == section && e.key == key) found = &e.value;
  return found;
}

double SimIni::getDouble(const std::string& section, const std::string& key, double fallback) const {
  const std::string* v = find(section, key);
  if (!v) return fallback;
  char* end = nullptr;
  const double d = std::strtod(v->c_str(), &end);
  if (end == v->c_str() || *end != '\0')
    throw std::runtime_error("[" + section + "] " + key + ": not a number: '" + *v + "'");
  return d;
}

int SimIni::getInt(const std::string& section, const std::string& key, int fallback) const {
  const std::string* v = find(section, key);
  if (!v) return fallback;
  char* end = nullptr;
  const long d = std::strtol(v->c_str(), &end, 10);
  if (end == v->c_str() || *end != '\0')
    throw std::runtime_error("[" + section + "] " + key + ": not an integer: '" + *v + "'");
  return static_cast<int>(d);
}

std::string SimIni::getString(const std::string& section, const std::string& key, const std::string& fallback) const {
  const std::string* v = find(section, key);
  return v ? *v : fallback;
}

// ------------------------------------------------------- SceneDescription

bool SceneDescription::load(const std::string& path, SceneDescription& out, std::string& error) {
  SimIni ini;
  if (!ini.load(path, error)) return false;
  if (!fromIni(ini, out, error)) {
    error = path + ": " + error;
    return false;
  }
  return true;
}

bool SceneDescription::fromIni(const SimIni& ini, SceneDescription& s, std::string& error) {
  try {
    s = SceneDescription{};
    s.mission = ini.getString("Mission", "mission", s.mission);
    s.carrierHz = ini.getDouble("Mission", "carrier_ghz", s.carrierHz / 1e9) * 1e9;
    s.samplingRateHz = ini.getDouble("Mission", "sampling_rate_mhz", s.samplingRateHz / 1e6) * 1e6;
    s.prfHz = ini.getDouble("Mission", "prf_hz", s.prfHz);
    s.pulseLength = ini.getDouble("Mission", "pulse_length_us", s.pulseLength * 1e6) * 1e-6;
    s.chirpCoefficient = ini.getDouble("Mission", "chirp_coefficient", s.chirpCoefficient);
    s.antennaLength = ini.getDouble("Mission", "antenna_length_m", s.antennaLength);
    const std::string side = ini.getString("Mission", "look_side", "right");
    if (side != "right" && side != "left") throw std::runtime_error("[Mission] look_side must be right or left");
    s.lookSign = side == "right" ? 1 : -1;

    KeplerElements& k = s.orbit;
    k.semiMajorAxis = ini.getDouble("Orbit", "semi_major_axis_m", k.semiMajorAxis);
    k.eccentricity = ini.getDouble("Orbit", "eccentricity", k.eccentricity);
    k.inclinationDeg = ini.getDouble("Orbit", "inclination_deg", k.inclinationDeg);
    k.nodeLongitudeDeg = ini.getDouble("Orbit", "node_longitude_deg", k.nodeLongitudeDeg);
    k.argPerigeeDeg = ini.getDouble("Orbit", "arg_perigee_deg", k.argPerigeeDeg);
    k.meanAnomalyDeg = ini.getDouble("Orbit", "mean_anomaly_deg", k.meanAnomalyDeg);

    const std::string start = ini.getString("Scene", "start_time", "18-JAN-2010 17:49:28.683");
    if (!simParseDate(start, s.startTime)) throw std::runtime_error("[Scene] start_time: bad date '" + start + "'");
    const std::string epoch = ini.getString("Orbit", "epoch", "");
    if (epoch.empty()) {
      k.epoch = s.startTime;
    } else if (!simParseDate(epoch, k.epoch)) {
      throw std::runtime_error("[Orbit] epoch: bad date '" + epoch + "'");
    }
    s.lines = ini.getInt("Scene", "lines", s.lines);
    s.samples = ini.getInt("Scene", "samples", s.samples);
    s.nearRangeTime = ini.getDouble("Scene", "near_range_time_s", s.nearRangeTime);
    s.dopplerCentroidHz = ini.getDouble("Scene", "doppler_centroid_hz", s.dopplerCentroidHz);
    if (ini.find("Scene", "yaw_deg") || ini.find("Scene", "pitch_deg")) {
      if (ini.find("Scene", "doppler_centroid_hz"))
        throw std::runtime_error("[Scene] give either doppler_centroid_hz or yaw_deg/pitch_deg, not both");
      s.attitudeGiven = true;
      s.yawDeg = ini.getDouble("Scene", "yaw_deg", 0.0);
      s.pitchDeg = ini.getDouble("Scene", "pitch_deg", 0.0);
    }
    s.patternExtent = ini.getDouble("Scene", "pattern_extent", s.patternExtent);
    s.swstChangeLine = ini.getInt("Scene", "swst_change_line", s.swstChangeLine);
    s.swstChangeCodes = ini.getInt("Scene", "swst_change_codes", s.swstChangeCodes);
    s.orbitNumber = ini.getInt("Scene", "orbit_number", s.orbitNumber);
    s.frame = ini.getInt("Scene", "frame", s.frame);
    s.arcNumber = ini.getInt("Scene", "arc_number", s.arcNumber);
    s.facility = ini.getString("Scene", "facility", s.facility);
    s.sceneDir = ini.getString("Scene", "scene_dir", s.sceneDir);
    s.upperCaseNames = ini.getString("Scene", "file_names", "upper") != "lower";
    s.xodr = ini.getString("Scene", "odr_form", "xODR") != "@ODR";
    s.odrRecords = ini.getInt("Scene", "odr_records", s.odrRecords);
    s.biasI = ini.getDouble("Scene", "bias_i", s.biasI);
    s.biasQ = ini.getDouble("Scene", "bias_q", s.biasQ);

    for (const SimIni::Entry& e : ini.entries) {
      if (e.section != "Targets") continue;
      std::istringstream is(e.value);
      double a = 0, b = 0, h = 0, amp = 1.0;
      if (!(is >> a >> b >> h)) throw std::runtime_error("[Targets] " + e.key + ": expected three or four numbers");
      if (!(is >> amp)) amp = 1.0;
      if (e.key.rfind("pixel_target", 0) == 0)
        s.pixelTargets.push_back({a, b, h, amp});
      else if (e.key.rfind("target", 0) == 0)
        s.targets.push_back({a, b, h, amp});
      else
        throw std::runtime_error("[Targets] unknown key " + e.key);
    }
    s.clutterSigma = ini.getDouble("Clutter", "clutter_sigma", s.clutterSigma);
    s.noiseSigma = ini.getDouble("Clutter", "noise_sigma", s.noiseSigma);
    s.seed = static_cast<std::uint64_t>(ini.getInt("Clutter", "seed", static_cast<int>(s.seed)));

    s.dropLines = parseIntList(ini.getString("Damage", "drop_lines", ""));
    s.corruptSwstLines = parseIntList(ini.getString("Damage", "corrupt_swst_lines", ""));
    s.corruptSwstDelta = ini.getInt("Damage", "corrupt_swst_delta", s.corruptSwstDelta);
    s.truncateImageBytes = static_cast<long long>(ini.getDouble("Damage", "truncate_image_bytes", 0.0));
    for (const SimIni::Entry& e : ini.entries) {
      if (e.section != "Damage" || e.key != "leader_patch") continue;
      std::istringstream is(e.value);
      int off = -1;
      is >> off;
      std::string text;
      std::getline(is, text);
      if (off < 0 || text.size() < 2) throw std::runtime_error("[Damage] leader_patch: expected offset and text");
      s.leaderPatches.emplace_back(off, text.substr(1));
    }
  } catch (const std::exception& ex) {
    error = ex.what();
    return false;
  }
  return true;
}

// ------------------------------------------------------ RawSceneSimulator

RawSceneSimulator::RawSceneSimulator(SceneDescription s) : scene_(std::move(s)) {
  SceneDescription& d = scene_;
  if (d.mission != "ERS1" && d.mission != "ERS2" && d.mission != "ENVISAT" && d.mission != "RSAT1" &&
      d.mission != "PALSAR")
    throw std::runtime_error("mission must be ERS1, ERS2, ENVISAT, RSAT1 or PALSAR, not " + d.mission);
  if (d.lines <= 0 || d.samples <= 0 || d.samples > 100000)
    throw std::runtime_error("lines and samples must be positive (samples at most 100000)");
  if (!(d.prfHz > 0) || !(d.samplingRateHz > 0) || !(d.pulseLength > 0) || !(d.carrierHz > 0) || !(d.antennaLength > 0))
    throw std::runtime_error("PRF, sampling rate, pulse length, carrier and antenna length must be positive");
  if (!(d.patternExtent > 0)) throw std::runtime_error("pattern extent must be positive");
  // Keep every value as the leader records it (RADARSAT values come from
  // the line codes and stand as given). A PALSAR leader records the
  // wavelength (7 decimals), the others the carrier.
  if (d.mission != "RSAT1") {
  d.carrierHz = d.mission == "PALSAR" ? kC / roundTrip("%16.7f", kC / d.carrierHz)
                                      : roundTrip("%8.3f", d.carrierHz / 1e9) * 1000000000.0;
  d.samplingRateHz = roundTrip("%16.7f", d.samplingRateHz / 1e6) * 1000000.0;
  d.prfHz = roundTrip("%16.7f", d.prfHz);
  d.pulseLength = roundTrip("%16.7f", d.pulseLength * 1e6) / 1000000.0;
  d.chirpCoefficient = roundTrip("%16.7e", d.chirpCoefficient);
  }
  d.startTime = std::round(d.startTime * 1000.0) / 1000.0;
  orbit_ = SimOrbit(d.orbit);

  swstCode_ = d.swstStep > 0.0
                  ? static_cast<int>(std::lround((d.nearRangeTime - d.swstOffset) / d.swstStep))
                  : static_cast<int>(std::lround((d.nearRangeTime - 0.005357529 + 6.627e-06) / 2.10943e-07));
  if (!d.lineWindowStarts.empty() && static_cast<int>(d.lineWindowStarts.size()) != d.lines)
    throw std::runtime_error("one window start per line is needed");
  if (d.lineWindowStarts.empty() && (swstCode_ < 0 || swstCode_ + d.swstChangeCodes < 0 ||
                                     swstCode_ + d.swstChangeCodes + d.corruptSwstDelta > 65535 ||
                                     swstCode_ + d.corruptSwstDelta > 65535))
    throw std::runtime_error("near range time gives a window code outside 0..65535");
  swst_ = d.lineWindowStarts.empty() ? swstSeconds(swstCode_) : d.lineWindowStarts.front();
  if (replicaLength() >= d.samples) throw std::runtime_error("the window is shorter than the pulse");
  if (d.attitudeGiven) d.dopplerCentroidHz = attitudeDoppler(d.yawDeg, d.pitchDeg);

  // Clutter filters: range band of the chirp, azimuth spectrum of the
  // two-way antenna pattern around the centroid (aliased into the PRF).
  const double beta = std::min(1.0, std::fabs(2.0 * d.pulseLength * d.chirpCoefficient) / d.samplingRateHz);
  double e = 0.0;
  for (int n = -kRangeTapHalf; n <= kRangeTapHalf; ++n) {
    const double w = 0.5 * (1.0 + std::cos(kPi * n / (kRangeTapHalf + 1)));
    rangeTaps_.push_back(static_cast<float>(beta * sinc(beta * n) * w));
    e += rangeTaps_.back() * rangeTaps_.back();
  }
  for (float& t : rangeTaps_) t = static_cast<float>(t / std::sqrt(e));
  const double v = norm(orbit_.at(lineTime(d.lines / 2)).vel);
  const int M = 512;
  std::vector<double> amp(M);
  for (int m = 0; m < M; ++m) {
    const double f = (m - M / 2) * d.prfHz / M;
    double p = 0.0;
    for (int a = -4; a <= 4; ++a) {
      const double x = d.antennaLength * (f + a * d.prfHz) / (2.0 * v);
      if (std::fabs(x) < d.patternExtent) p += std::pow(sinc(x), 4);
    }
    amp[m] = std::sqrt(p);
  }
  e = 0.0;
  for (int n = -kAzimuthTapHalf; n <= kAzimuthTapHalf; ++n) {
    std::complex<double> h = 0.0;
    for (int m = 0; m < M; ++m) {
      const double f = (m - M / 2) * d.prfHz / M + d.dopplerCentroidHz;
      h += amp[m] * std::polar(1.0, 2.0 * kPi * f * n / d.prfHz);
    }
    h *= 0.5 * (1.0 + std::cos(kPi * n / (kAzimuthTapHalf + 1))) / M;
    azimuthTaps_.emplace_back(static_cast<float>(h.real()), static_cast<float>(h.imag()));
    e += std::norm(h);
  }
  for (fcomplex& t : azimuthTaps_) t /= static_cast<float>(std::sqrt(e));
  computeTruth();
}

double RawSceneSimulator::wavelength() const { return kC / scene_.carrierHz; }

int RawSceneSimulator::replicaLength() const {
  return static_cast<int>(std::lround(scene_.samplingRateHz * scene_.pulseLength));
}

double RawSceneSimulator::rangePeakOffset() const {
  return (scene_.samplingRateHz * scene_.pulseLength - (replicaLength() - 1)) / 2.0;
}

int RawSceneSimulator::swstCodeOf(int line) const {
  return (scene_.swstChangeLine >= 0 && line >= scene_.swstChangeLine) ? swstCode_ + scene_.swstChangeCodes : swstCode_;
}

double RawSceneSimulator::swstSeconds(int code) const {
  return scene_.swstStep > 0.0 ? code * scene_.swstStep + scene_.swstOffset : ersSwstSeconds(code);
}

int RawSceneSimulator::priCode() const {
  return static_cast<int>(std::lround(scene_.samplingRateHz / (4.0 * scene_.prfHz))) - 2;
}

double RawSceneSimulator::attitudeDoppler(double yawDeg, double pitchDeg) const {
  const SceneDescription& d = scene_;
  const StateVector sv = orbit_.at(lineTime(d.lines / 2));
  const double R = kC / 2.0 * (swst_ + 0.5 * d.samples / d.samplingRateHz);
  double lat = 0, lon = 0;
  if (!zeroDopplerPoint(orbit_, sv.t, R, 0.0, d.lookSign, lat, lon))
    throw std::runtime_error("no scene centre on the ground for the attitude");
  Vec3 u = geodeticToEcef(lat, lon, 0.0) - sv.pos;
  u = (1.0 / norm(u)) * u;
  // Rodrigues rotation of u by angle a about the unit axis k.
  auto rotate = [](const Vec3& v, const Vec3& k, double a) {
    return std::cos(a) * v + std::sin(a) * cross(k, v) + (dot(k, v) * (1.0 - std::cos(a))) * k;
  };
  const Vec3 down = (-1.0 / norm(sv.pos)) * sv.pos;
  Vec3 right = cross(down, (1.0 / norm(sv.vel)) * sv.vel);
  right = (1.0 / norm(right)) * right;
  u = rotate(u, down, -d.lookSign * yawDeg * kPi / 180.0);
  u = rotate(u, right, pitchDeg * kPi / 180.0);
  return 2.0 / wavelength() * dot(sv.vel, u);
}

void RawSceneSimulator::computeTruth() {
  const SceneDescription& d = scene_;
  const double lambda = wavelength();
  std::vector<SimTarget> all = d.targets;
  for (const SimPixelTarget& p : d.pixelTargets) {
    const double t = d.startTime + p.line / d.prfHz;
    const double R = kC / 2.0 * (swst_ + (p.sample - rangePeakOffset()) / d.samplingRateHz);
    SimTarget s;
    if (!zeroDopplerPoint(orbit_, t, R, p.height, d.lookSign, s.latDeg, s.lonDeg))
      throw std::runtime_error("no ground point for the pixel target at line " + std::to_string(p.line));
    s.height = p.height;
    s.amplitude = p.amplitude;
    all.push_back(s);
  }
  const double tMid = lineTime(d.lines / 2);
  for (const SimTarget& s : all) {
    TargetTruth t;
    t.latDeg = s.latDeg;
    t.lonDeg = s.lonDeg;
    t.height = s.height;
    t.amplitude = s.amplitude;
    t.position = geodeticToEcef(s.latDeg, s.lonDeg, s.height);
    t.azimuthTime = closestApproachTime(orbit_, t.position, tMid);
    t.slantRange = norm(orbit_.at(t.azimuthTime).pos - t.position);
    t.rangeTime = 2.0 * t.slantRange / kC;
    t.expectedPhase = wrapPhase(-4.0 * kPi * t.slantRange / lambda);
    t.line = (t.azimuthTime - d.startTime) * d.prfHz;
    t.sample = (t.rangeTime - swst_) * d.samplingRateHz + rangePeakOffset();
    // Azimuth pattern argument, decreasing with time through the pass.
    auto x = [&](double time) {
      const StateVector sv = orbit_.at(time);
      return d.antennaLength * (pointDoppler(sv, t.position, lambda) - d.dopplerCentroidHz) / (2.0 * norm(sv.vel));
    };
    auto solve = [&](double target, double a, double b) {
      for (int it = 0; it < 80; ++it) {
        const double m = 0.5 * (a + b);
        if (x(m) > target) a = m; else b = m;
      }
      return 0.5 * (a + b);
    };
    const double span = 60.0;
    t.beamCentreTime = solve(0.0, t.azimuthTime - span, t.azimuthTime + span);
    const double tLo = solve(d.patternExtent, t.azimuthTime - span, t.beamCentreTime);
    const double tHi = solve(-d.patternExtent, t.beamCentreTime, t.azimuthTime + span);
    t.firstLine = static_cast<int>(std::ceil((tLo - d.startTime) * d.prfHz));
    t.lastLine = static_cast<int>(std::floor((tHi - d.startTime) * d.prfHz));
    truth_.push_back(t);
  }
}

void RawSceneSimulator::addTargets(int line, fcomplex* row) const {
  const SceneDescription& d = scene_;
  const double lambda = wavelength();
  const double fs = d.samplingRateHz, T = d.pulseLength, K = chirpRate();
  const double dt = 1.0 / fs;
  const double swst = d.lineWindowStarts.empty() ? swstSeconds(swstCodeOf(line))
                                                 : d.lineWindowStarts[static_cast<std::size_t>(line)];
  StateVector sv{};
  bool haveSv = false;
  for (const TargetTruth& t : truth_) {
    if (line < t.firstLine || line > t.lastLine) continue;
    if (!haveSv) {
      sv = orbit_.at(lineTime(line));
      haveSv = true;
    }
    const Vec3 dv = sv.pos - t.position;
    const double R = norm(dv);
    const double f = -2.0 / lambda * dot(dv, sv.vel) / R;
    const double x = d.antennaLength * (f - d.dopplerCentroidHz) / (2.0 * norm(sv.vel));
    if (std::fabs(x) >= d.patternExtent) continue;
    const double s = sinc(x);
    const double a = t.amplitude * s * s;
    const double tau = 2.0 * R / kC;
    const int j0 = std::max(0, static_cast<int>(std::ceil((tau - swst) * fs)));
    const int j1 = std::min(d.samples, static_cast<int>(std::ceil((tau + T - swst) * fs)));
    const double carrier = wrapPhase(-4.0 * kPi * R / lambda);
    // Chirp exp(j pi K u^2), u from the pulse centre; phase advanced by a
    // second-order recursion, re-seeded exactly every 64 samples.
    std::complex<double> z, w;
    const std::complex<double> ww = std::polar(1.0, 2.0 * kPi * K * dt * dt);
    for (int j = j0; j < j1; ++j) {
      const double u = swst + j * dt - tau - 0.5 * T;
      if (((j - j0) & 63) == 0) {
        z = std::polar(a, kPi * K * u * u + carrier);
        w = std::polar(1.0, kPi * K * (2.0 * u * dt + dt * dt));
      }
      row[j] += fcomplex(static_cast<float>(z.real()), static_cast<float>(z.imag()));
      z *= w;
      w *= ww;
    }
  }
}

void RawSceneSimulator::renderLines(int first, int count, std::vector<fcomplex>& out) const {
  const SceneDescription& d = scene_;
  const int S = d.samples;
  out.assign(static_cast<std::size_t>(count) * S, fcomplex(0.0f, 0.0f));
  if (d.clutterSigma > 0.0) {
    const int H = kAzimuthTapHalf, Rh = kRangeTapHalf;
    const int rows = count + 2 * H;
    std::vector<fcomplex> filtered(static_cast<std::size_t>(rows) * S);
    const float sigma = static_cast<float>(d.clutterSigma);
#pragma omp parallel
    {
      std::vector<fcomplex> raw(S + 2 * Rh);
#pragma omp for schedule(static)
      for (int r = 0; r < rows; ++r) {
        const std::int64_t row = static_cast<std::int64_t>(first) - H + r;
        for (int j = 0; j < S + 2 * Rh; ++j) raw[j] = gaussCell(d.seed, 1, row, j - Rh);
        fcomplex* o = filtered.data() + static_cast<std::size_t>(r) * S;
        for (int j = 0; j < S; ++j) {
          fcomplex acc(0.0f, 0.0f);
          for (int n = 0; n <= 2 * Rh; ++n) acc += rangeTaps_[n] * raw[j + n];
          o[j] = acc * sigma;
        }
      }
    }
    // Azimuth filter per range frequency. A scatterer's Doppler scales with
    // the radio frequency, so at baseband range frequency fr the clutter
    // spectrum is centred on fdc (1 + fr / fc): tap m of the azimuth filter
    // is turned by exp(j 2 pi fdc (fr / fc) m / PRF). Without this the
    // clutter would carry the centroid only modulo the PRF.
    const int P = nextPowerOfTwo(S);
    std::vector<cdouble> spec(static_cast<std::size_t>(rows) * P);
#pragma omp parallel for schedule(static)
    for (int r = 0; r < rows; ++r) {
      cdouble* x = spec.data() + static_cast<std::size_t>(r) * P;
      const fcomplex* src = filtered.data() + static_cast<std::size_t>(r) * S;
      for (int j = 0; j < S; ++j) x[j] = cdouble(src[j].real(), src[j].imag());
      simFft(x, P, -1);
    }
    const int nt = 2 * H + 1;
    std::vector<cdouble> taps(static_cast<std::size_t>(nt) * P);
    for (int b = 0; b < P; ++b) {
      const double fr = (b < P / 2 ? b : b - P) * d.samplingRateHz / P;
      const double shift = d.dopplerCentroidHz * fr / d.carrierHz;
      for (int m = -H; m <= H; ++m) {
        const fcomplex h = azimuthTaps_[H + m];
        taps[static_cast<std::size_t>(m + H) * P + b] =
            cdouble(h.real(), h.imag()) * std::polar(1.0 / P, 2.0 * kPi * shift * m / d.prfHz);
      }
    }
#pragma omp parallel
    {
      std::vector<cdouble> acc(P);
#pragma omp for schedule(static)
      for (int k = 0; k < count; ++k) {
        std::fill(acc.begin(), acc.end(), cdouble(0.0, 0.0));
        // Output line k + H of the filtered rows takes row k + H - m with tap m.
        for (int m = -H; m <= H; ++m) {
          const cdouble* x = spec.data() + static_cast<std::size_t>(k + H - m) * P;
          const cdouble* t = taps.data() + static_cast<std::size_t>(m + H) * P;
          for (int b = 0; b < P; ++b) acc[b] += t[b] * x[b];
        }
        simFft(acc.data(), P, 1);
        fcomplex* o = out.data() + static_cast<std::size_t>(k) * S;
        for (int j = 0; j < S; ++j)
          o[j] = fcomplex(static_cast<float>(acc[j].real()), static_cast<float>(acc[j].imag()));
      }
    }
  }
#pragma omp parallel for schedule(dynamic, 8)
  for (int k = 0; k < count; ++k) {
    fcomplex* o = out.data() + static_cast<std::size_t>(k) * S;
    addTargets(first + k, o);
    if (d.noiseSigma > 0.0) {
      const float sigma = static_cast<float>(d.noiseSigma);
      for (int j = 0; j < S; ++j) o[j] += sigma * gaussCell(d.seed, 2, first + k, j);
    }
  }
}

void RawSceneSimulator::quantiseLine(const fcomplex* in, unsigned char* iq) const {
  const float bi = static_cast<float>(scene_.biasI < -100.0 ? 0.0 : scene_.biasI);
  const float bq = static_cast<float>(scene_.biasQ < -100.0 ? 0.0 : scene_.biasQ);
  auto q = [](float v) {
    const float x = std::floor(v + 16.0f);  // nearest level of byte - 15.5
    return static_cast<unsigned char>(std::clamp(x, 0.0f, 31.0f));
  };
  for (int j = 0; j < scene_.samples; ++j) {
    iq[2 * j] = q(in[j].real() + bi);
    iq[2 * j + 1] = q(in[j].imag() + bq);
  }
}

// ------------------------------------------------------------------ files

std::string RawSceneSimulator::leaderPath(const std::string& outDir) const {
  return outDir + "/" + scene_.sceneDir + (scene_.upperCaseNames ? "/LEA_01.001" : "/lea_01.001");
}

std::string RawSceneSimulator::imagePath(const std::string& outDir) const {
  return outDir + "/" + scene_.sceneDir + (scene_.upperCaseNames ? "/DAT_01.001" : "/dat_01.001");
}

std::string RawSceneSimulator::odrPath(const std::string& outDir) const {
  char name[64];
  std::snprintf(name, sizeof name, "/orbits/%s/PRECISE/ODR.%03d", scene_.mission.c_str(), scene_.arcNumber);
  return outDir + name;
}

int RawSceneSimulator::writeErsScene(const std::string& outDir, std::string& error) const {
  namespace stdfs = std::filesystem;
  const SceneDescription& d = scene_;
  std::error_code ec;
  for (const std::string& sub : {d.sceneDir, std::string("orbits/ERS1/PRECISE"), "orbits/" + d.mission + "/PRECISE"}) {
    stdfs::create_directories(outDir + "/" + sub, ec);
    if (ec) {
      error = "cannot create " + outDir + "/" + sub + ": " + ec.message();
      return 5;
    }
  }
  const double lambda = wavelength();
  const double fs = d.samplingRateHz;

  // Leader.
  ErsLeaderInfo L;
  L.mission = d.mission;
  char designator[40];
  std::snprintf(designator, sizeof designator, "ORBIT=%05d-FRAME=%04d", d.orbitNumber, d.frame);
  L.sceneDesignator = designator;
  const double tMid = lineTime(d.lines / 2);
  L.sceneCentreTime = tMid;
  const double rMid = kC / 2.0 * (swst_ + 0.5 * d.samples / fs);
  double clat = 0, clon = 0;
  if (!zeroDopplerPoint(orbit_, tMid, rMid, 0.0, d.lookSign, clat, clon)) {
    error = "no scene centre on the ground";
    return 5;
  }
  L.sceneCentreLat = clat;
  L.sceneCentreLon = clon;
  L.centreLine = d.lines / 2;
  L.centrePixel = d.samples / 2;
  const StateVector svMid = orbit_.at(tMid);
  double plat = 0, plon = 0, ph = 0;
  ecefToGeodetic(svMid.pos, plat, plon, ph);
  const double la = plat * kPi / 180.0, lo = plon * kPi / 180.0;
  const Vec3 east{-std::sin(lo), std::cos(lo), 0.0};
  const Vec3 north{-std::sin(la) * std::cos(lo), -std::sin(la) * std::sin(lo), std::cos(la)};
  double heading = std::atan2(dot(svMid.vel, east), dot(svMid.vel, north)) * 180.0 / kPi;
  if (heading < 0) heading += 360.0;
  L.platformLat = plat;
  L.platformLon = plon;
  L.platformHeading = heading;
  const Vec3 pc = geodeticToEcef(clat, clon, 0.0);
  const double cl = clat * kPi / 180.0, co = clon * kPi / 180.0;
  const Vec3 up{std::cos(cl) * std::cos(co), std::cos(cl) * std::sin(co), std::sin(cl)};
  const Vec3 look = svMid.pos - pc;
  L.incidenceDeg = std::acos(dot(look, up) / norm(look)) * 180.0 / kPi;
  const double groundSpeed = norm(svMid.vel) * norm(pc) / norm(svMid.pos);
  L.lineSpacing = groundSpeed / d.prfHz;
  L.pixelSpacing = kC / (2.0 * fs) / std::sin(L.incidenceDeg * kPi / 180.0);
  L.sceneLengthKm = L.lineSpacing * d.lines / 1000.0;
  L.sceneWidthKm = L.pixelSpacing * d.samples / 1000.0;
  L.orbitNumber = d.orbitNumber;
  L.radarFreqGHz = d.carrierHz / 1e9;
  L.wavelength = lambda;
  L.chirpCoefficient = d.chirpCoefficient;
  L.samplingRateMHz = fs / 1e6;
  L.pulseLengthUs = d.pulseLength * 1e6;
  L.biasI = d.biasI;
  L.biasQ = d.biasQ;
  L.prf = d.prfHz;
  L.facility = d.facility;
  L.firstRangeTimeMs = swst_ * 1000.0;
  L.centreRangeTimeMs = (swst_ + 0.5 * d.samples / fs) * 1000.0;
  L.lastRangeTimeMs = (swst_ + d.samples / fs) * 1000.0;
  L.firstLineTime = d.startTime;
  L.centreLineTime = tMid;
  L.lastLineTime = lineTime(d.lines - 1);
  L.firstVectorTime = d.startTime;
  L.vectorInterval = std::max(0.001, std::round((L.lastLineTime - d.startTime) / 4.0 * 1000.0) / 1000.0);
  for (int k = 0; k < 5; ++k) L.vectors.push_back(orbit_.at(d.startTime + k * L.vectorInterval));
  std::vector<char> leader;
  try {
    leader = buildErsLeader(L);
  } catch (const std::exception& ex) {
    error = std::string("leader: ") + ex.what();
    return 5;
  }
  for (const auto& [off, text] : d.leaderPatches) {
    if (off < 0 || off + text.size() > leader.size()) {
      error = "leader patch outside the leader at offset " + std::to_string(off);
      return 5;
    }
    std::memcpy(leader.data() + off, text.data(), text.size());
  }
  if (!writeFile(leaderPath(outDir), leader.data(), leader.size(), error)) return 5;

  // Image file.
  std::vector<char> dropped(d.lines, 0), corrupt(d.lines, 0);
  for (int k : d.dropLines)
    if (k >= 0 && k < d.lines) dropped[k] = 1;
  for (int k : d.corruptSwstLines)
    if (k >= 0 && k < d.lines) corrupt[k] = 1;
  int records = 0;
  for (int k = 0; k < d.lines; ++k) records += dropped[k] ? 0 : 1;
  const std::string mission = d.mission;
  const std::vector<char> descriptor = buildErsImageDescriptor(mission, "SIM-ERS-1.0", records, d.samples);
  {
    std::ofstream f(imagePath(outDir), std::ios::binary | std::ios::trunc);
    if (!f || !f.write(descriptor.data(), static_cast<std::streamsize>(descriptor.size()))) {
      error = "cannot write " + imagePath(outDir);
      return 5;
    }
    const int block = 512;
    const std::size_t recLen = kErsDataPrefix + 2 * static_cast<std::size_t>(d.samples);
    std::vector<fcomplex> echoes;
    std::vector<char> bytes;
    std::vector<int> position(d.lines, -1);
    for (int k = 0, p = 0; k < d.lines; ++k)
      if (!dropped[k]) position[k] = p++;
    for (int first = 0; first < d.lines; first += block) {
      const int count = std::min(block, d.lines - first);
      renderLines(first, count, echoes);
      bytes.assign(recLen * count, 0);
#pragma omp parallel
      {
        std::vector<unsigned char> iq(2 * static_cast<std::size_t>(d.samples));
#pragma omp for schedule(static)
        for (int k = 0; k < count; ++k) {
          const int line = first + k;
          quantiseLine(echoes.data() + static_cast<std::size_t>(k) * d.samples, iq.data());
          const int code = swstCodeOf(line) + (corrupt[line] ? d.corruptSwstDelta : 0);
          buildErsDataRecord(bytes.data() + recLen * k, static_cast<std::uint32_t>(position[line] + 2),
                             static_cast<std::uint32_t>(line + 1), d.samples, static_cast<std::uint16_t>(code),
                             static_cast<std::uint16_t>(priCode()), static_cast<std::uint32_t>(163840 + line),
                             iq.data());
        }
      }
      for (int k = 0; k < count; ++k)
        if (!dropped[first + k] && !f.write(bytes.data() + recLen * k, static_cast<std::streamsize>(recLen))) {
          error = "cannot write " + imagePath(outDir);
          return 5;
        }
    }
  }
  if (d.truncateImageBytes > 0) {
    stdfs::resize_file(imagePath(outDir), static_cast<std::uintmax_t>(d.truncateImageBytes), ec);
    if (ec) {
      error = "cannot truncate " + imagePath(outDir);
      return 5;
    }
  }

  // Volume directory and null volume.
  const std::vector<char> vdf = buildErsVolumeDirectory(mission, d.facility, d.orbitNumber, d.startTime, records, d.samples);
  const std::vector<char> nul = buildErsNullVolume(d.facility);
  const std::string dir = outDir + "/" + d.sceneDir;
  if (!writeFile(dir + (d.upperCaseNames ? "/VDF_DAT.001" : "/vdf_dat.001"), vdf.data(), vdf.size(), error)) return 5;
  if (!writeFile(dir + (d.upperCaseNames ? "/NUL_DAT.001" : "/nul_dat.001"), nul.data(), nul.size(), error)) return 5;

  // Orbit arc centred on the scene, and the archive's arc list.
  const int n = std::max(30, d.odrRecords);
  const double mid = 0.5 * (d.startTime + lineTime(d.lines - 1));
  const double firstTime = std::floor(mid / 60.0) * 60.0 - 60.0 * ((n - 1) / 2);
  std::vector<OdrPoint> pts(n);
  for (int i = 0; i < n; ++i) {
    const StateVector sv = orbit_.at(firstTime + 60.0 * i);
    ecefToDeos(sv.pos, pts[i].latDeg, pts[i].lonDeg, pts[i].height);
  }
  const std::vector<char> odr = buildDeosOdr(d.mission == "ERS1" ? "ERS-1" : "ERS-2", d.xodr, d.arcNumber,
                                             static_cast<std::int32_t>(firstTime), static_cast<std::int32_t>(firstTime), pts);
  if (!writeFile(odrPath(outDir), odr.data(), odr.size(), error)) return 5;
  const double validStart = firstTime + 300.0, validEnd = firstTime + 60.0 * (n - 1) - 300.0;
  std::vector<ArcEntry> arcs;
  arcs.push_back({d.arcNumber - 1, validStart - 5.0 * 86400.0, validStart});
  arcs.push_back({d.arcNumber, validStart, validEnd});
  arcs.push_back({d.arcNumber + 1, validEnd, validEnd + 5.0 * 86400.0});
  const std::string list = buildArclist(arcs);
  if (!writeFile(outDir + "/orbits/ERS1/PRECISE/arclist", list.data(), list.size(), error)) return 5;

  return writeTruth(outDir + "/truth.txt", error);
}

int RawSceneSimulator::writeTruth(const std::string& path, std::string& error) const {
  const SceneDescription& d = scene_;
  std::ostringstream o;
  char b[256];
  auto kv = [&](const char* key, const char* fmt, double v) {
    std::snprintf(b, sizeof b, fmt, v);
    o << key << " = " << b << "\n";
  };
  const StateVector svMid = orbit_.at(lineTime(d.lines / 2));
  o << "[Scene]\n";
  o << "mission = " << d.mission << "\n";
  kv("carrier_frequency_hz", "%.6f", d.carrierHz);
  kv("wavelength_m", "%.15e", wavelength());
  kv("prf_hz", "%.9f", d.prfHz);
  kv("range_sampling_rate_hz", "%.6f", d.samplingRateHz);
  kv("pulse_length_s", "%.15e", d.pulseLength);
  kv("chirp_rate_hz_per_s", "%.9e", chirpRate());
  kv("replica_samples", "%.0f", replicaLength());
  kv("range_peak_offset_samples", "%.9f", rangePeakOffset());
  kv("first_line_time", "%.9f", d.startTime);
  o << "first_line_time_text = " << simDateText(d.startTime) << "\n";
  kv("lines", "%.0f", d.lines);
  kv("samples", "%.0f", d.samples);
  kv("swst_code", "%.0f", swstCode_);
  kv("window_start_s", "%.15e", swst_);
  kv("doppler_centroid_hz", "%.6f", d.dopplerCentroidHz);
  kv("look_sign", "%.0f", d.lookSign);
  kv("azimuth_pixel_spacing_m", "%.6f", norm(svMid.vel) * 6371000.0 / norm(svMid.pos) / d.prfHz);
  kv("range_pixel_spacing_m", "%.6f", kC / (2.0 * d.samplingRateHz));
  kv("targets", "%.0f", static_cast<double>(truth_.size()));
  for (std::size_t i = 0; i < truth_.size(); ++i) {
    const TargetTruth& t = truth_[i];
    o << "\n[Target" << (i + 1) << "]\n";
    kv("latitude_deg", "%.10f", t.latDeg);
    kv("longitude_deg", "%.10f", t.lonDeg);
    kv("height_m", "%.4f", t.height);
    kv("amplitude", "%.6g", t.amplitude);
    kv("azimuth_time", "%.9f", t.azimuthTime);
    o << "azimuth_time_text = " << simDateText(t.azimuthTime) << "\n";
    kv("range_time_s", "%.15e", t.rangeTime);
    kv("slant_range_m", "%.6f", t.slantRange);
    kv("expected_phase_rad", "%.9f", t.expectedPhase);
    kv("line", "%.6f", t.line);
    kv("sample", "%.6f", t.sample);
    kv("beam_centre_time", "%.9f", t.beamCentreTime);
    kv("first_echo_line", "%.0f", t.firstLine);
    kv("last_echo_line", "%.0f", t.lastLine);
  }
  const std::string text = o.str();
  return writeFile(path, text.data(), text.size(), error) ? 0 : 5;
}
