// ASAR level-0 products of the simulator.
#include "sim/envisat_level0_writer.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>

#include "base/constants.h"
#include "product/time_base.h"
#include "sim/envisat_aux_writer.h"

namespace {

constexpr int kHead = 68, kDataFieldHeader = 29;
constexpr int kImStart = 105, kImCycle = 1024, kApStart = 210;

struct ModeCodes {
  const char* name;
  const char* productType;
  int modeId, applicationId;
  int polBits[2];  // bits 6 and 5 of head byte 61 for polarisation 0 and 1
};
const ModeCodes& modeCodes(const std::string& mode) {
  static const ModeCodes kCodes[4] = {{"IM", "ASA_IM__0", 84, 1556, {0, 0}},
                                      {"APC", "ASA_APC_0", 103, 1543, {3, 0}},
                                      {"APH", "ASA_APH_0", 104, 1544, {1, 0}},
                                      {"APV", "ASA_APV_0", 164, 1549, {3, 2}}};
  for (const ModeCodes& m : kCodes)
    if (mode == m.name) return m;
  throw std::runtime_error("[ASAR] mode must be IM, APC, APH or APV, not " + mode);
}

void putText(std::string& s, std::size_t at, const std::string& text) { s.replace(at, text.size(), text); }

std::vector<int> intList(const std::string& text) {
  std::vector<int> v;
  std::istringstream is(text);
  int x;
  while (is >> x) v.push_back(x);
  return v;
}

// Specific header of a level-0 product with the fields extraction reads.
std::string level0Sph(const AsarSimConfig& cfg, const ModeCodes& m, double startLat, double stopLat, double track,
                      long records) {
  std::string s(1956, ' ');
  putText(s, 0, std::string("SPH_DESCRIPTOR=\"") + m.productType + "P SPECIFIC HEADER  \"\n");
  char b[96];
  std::snprintf(b, sizeof b, "START_LAT=%+011ld<10-6degN>\n", std::lround(startLat * 1e6));
  putText(s, 46, b);
  std::snprintf(b, sizeof b, "STOP_LAT=%+011ld<10-6degN>\n", std::lround(stopLat * 1e6));
  putText(s, 111, b);
  std::snprintf(b, sizeof b, "SAT_TRACK=%+15.8E<deg>\n", track);
  putText(s, 174, b);
  std::string pol = cfg.imageMode() ? cfg.polarisation : std::string(m.name) == "APV" ? "V/V" : "H/H";
  pol.resize(5, ' ');
  putText(s, 762, "TX_RX_POLAR=\"" + pol + "\"\n");
  putText(s, 782, "SWATH=\"IS" + std::to_string(cfg.swath) + "\"\n");
  putText(s, 900, "DS_NAME=\"ASAR_SOURCE_PACKETS         \"\n");
  std::snprintf(b, sizeof b, "NUM_DSR=+%010ld\n", records);
  putText(s, 1035, b);
  s[1955] = '\n';
  return s;
}

// Labels of the two channels of an alternating-polarisation mode, in the
// order of their polarisation index.
std::pair<const char*, const char*> channelLabels(const std::string& mode) {
  if (mode == "APC") return {"V/V", "H/H"};
  if (mode == "APH") return {"H/V", "H/H"};
  return {"V/V", "V/H"};
}

// The burst timing of an alternating-polarisation scene for the analysis of
// its channels: a burst of `echoes` lines of one polarisation, then as many
// of the other, so that each channel repeats every `cycle_lines` lines;
// `first_burst_line_k` is a line (possibly before line 0) where a burst of
// channel k begins.
int appendBurstTruth(const std::string& path, const AsarSimConfig& cfg, std::string& error) {
  const int e = cfg.burstEchoes();
  const int into = ((cfg.firstLineCounter() - kApStart) % (2 * e) + 2 * e) % (2 * e);
  const auto [label0, label1] = channelLabels(cfg.mode);
  std::ofstream out(path, std::ios::app);
  out << "\n[Bursts]\n"
      << "echoes = " << e << "\n"
      << "cycle_lines = " << 2 * e << "\n"
      << "first_burst_line_0 = " << -into << "\n"
      << "first_burst_line_1 = " << e - into << "\n"
      << "polarisation_0 = " << label0 << "\n"
      << "polarisation_1 = " << label1 << "\n";
  if (!out) {
    error = "cannot write " + path;
    return 5;
  }
  return 0;
}

}  // namespace

int AsarSimConfig::firstLineCounter() const {
  if (firstCounter >= 0) return firstCounter;
  return imageMode() ? kImStart + 2 * kImCycle + 700 : kApStart + 6 * burstEchoes() + burstEchoes() / 2;
}

int AsarSimConfig::burstEchoes() const {
  return apBurst > 0 ? apBurst : asar_sim::kApBurstEchoes[std::clamp(swath, 1, 7) - 1];
}

bool asarLineIsEcho(const AsarSimConfig& cfg, int line) {
  const int c = cfg.firstLineCounter() + line;
  if (!cfg.imageMode()) return c >= kApStart;
  return c >= kImStart && (c - kImStart) % kImCycle != kImCycle - 1;
}

int asarLinePolarisation(const AsarSimConfig& cfg, int line) {
  if (cfg.imageMode()) return 0;
  return ((cfg.firstLineCounter() + line - kApStart) / cfg.burstEchoes()) % 2;
}

bool AsarSimConfig::fromIni(const SimIni& ini, AsarSimConfig& c, std::string& error) {
  try {
    c = AsarSimConfig{};
    c.mode = ini.getString("ASAR", "mode", c.mode);
    modeCodes(c.mode);
    c.swath = ini.getInt("ASAR", "swath", c.swath);
    if (c.swath < 1 || c.swath > 7) throw std::runtime_error("[ASAR] swath must be 1 to 7");
    c.polarisation = ini.getString("ASAR", "polarisation", c.polarisation);
    c.firstCounter = ini.getInt("ASAR", "first_counter", c.firstCounter);
    c.apBurst = ini.getInt("ASAR", "ap_burst_echoes", c.apBurst);
    c.priCode = ini.getInt("ASAR", "pri_code", c.priCode);
    c.pulseCode = ini.getInt("ASAR", "pulse_code", c.pulseCode);
    c.chirpCode = ini.getInt("ASAR", "chirp_code", c.chirpCode);
    c.absoluteOrbit = ini.getInt("ASAR", "absolute_orbit", c.absoluteOrbit);
    if (c.priCode < 1 || c.pulseCode < 1 || c.pulseCode > 1023 || c.chirpCode < 1 || c.chirpCode > 255)
      throw std::runtime_error("[ASAR] pri_code, pulse_code (1..1023) and chirp_code (1..255) are out of range");
    std::istringstream g(ini.getString("ASAR", "garbage", ""));
    std::string item;
    while (g >> item) {
      const auto colon = item.find(':');
      if (colon == std::string::npos) throw std::runtime_error("[ASAR] garbage: expected line:bytes, not " + item);
      c.garbage.emplace_back(std::stoi(item.substr(0, colon)), std::stoi(item.substr(colon + 1)));
    }
    c.counterJumpLines = intList(ini.getString("ASAR", "counter_jump_lines", ""));
  } catch (const std::exception& ex) {
    error = ex.what();
    return false;
  }
  return true;
}

void applyAsarInstrument(const AsarSimConfig& cfg, SceneDescription& s) {
  const double fs = asar_sim::kSamplingHz;
  s.mission = "ENVISAT";
  s.carrierHz = asar_sim::kCarrierHz;
  s.samplingRateHz = fs;
  s.prfHz = fs / cfg.priCode;
  s.pulseLength = cfg.pulseCode / fs;
  const double bandwidth = cfg.chirpCode * 62745.098039215685;
  s.chirpCoefficient = bandwidth / (2.0 * s.pulseLength);
  s.antennaLength = 10.0;
  s.swstStep = 1.0 / fs;
  s.swstOffset = asar_sim::kRanks[cfg.swath - 1] / s.prfHz - double(asar_sim::kRangeGateBias);
}

int writeEnvisatScene(const RawSceneSimulator& sim, const AsarSimConfig& cfg, const std::string& outDir,
                      AsarSceneFiles* files, std::string& error) {
  namespace fs = std::filesystem;
  const SceneDescription& d = sim.scene();
  const ModeCodes& m = modeCodes(cfg.mode);
  const double t0 = d.startTime, t1 = sim.lineTime(d.lines - 1);
  std::error_code ec;
  AsarSceneFiles f;
  f.auxDir = outDir + "/aux";
  f.orbitDir = outDir + "/orbits";
  fs::create_directories(f.auxDir, ec);
  fs::create_directories(f.orbitDir, ec);

  // Auxiliary files valid a year around the scene, generated a month before.
  const double day = 86400.0, generation = t0 - 30 * day;
  f.ins = f.auxDir + "/" + envisatAuxName("ASA_INS_AXVIEC", generation, t0 - 365 * day, t0 + 365 * day);
  f.xca = f.auxDir + "/" + envisatAuxName("ASA_XCA_AXVIEC", generation, t0 - 365 * day, t0 + 365 * day);
  f.xch = f.auxDir + "/" + envisatAuxName("ASA_XCH_AXVIEC", generation, t0 - 365 * day, t0 + 365 * day);
  const double orbitStart = std::floor(t0 / 60.0) * 60.0 - 600.0, orbitStop = t1 + 660.0;
  f.orbit = f.orbitDir + "/" + envisatAuxName("DOR_VOR_AXVF-P", t0 + 20 * day, orbitStart, orbitStop);
  if (int st = writeAsarIns(f.ins, generation, t0 - 365 * day, t0 + 365 * day, error); st != 0) return st;
  if (int st = writeAsarXca(f.xca, generation, t0 - 365 * day, t0 + 365 * day, error); st != 0) return st;
  if (int st = writeAsarXch(f.xch, generation, t0 - 365 * day, t0 + 365 * day, error); st != 0) return st;
  if (int st = writeDorVor(f.orbit, sim.orbit(), t0 + 20 * day, orbitStart, orbitStop, cfg.absoluteOrbit, error);
      st != 0)
    return st;

  // Product name: type, start, duration, relative and absolute orbit.
  char name[80];
  std::snprintf(name, sizeof name, "%sCNPDE%s_%08ld%04ld_%05d_%05d_0000.N1", m.productType,
                envisatCompact(t0).c_str(), 0L, std::lround(t1 - t0), cfg.absoluteOrbit % 501, cfg.absoluteOrbit);
  f.level0 = outDir + "/" + name;

  double lat0 = 0, lon0 = 0, h0 = 0, lat1 = 0, lon1 = 0, h1 = 0;
  const StateVector s0 = sim.orbit().at(t0), s1 = sim.orbit().at(t1);
  ecefToGeodetic(s0.pos, lat0, lon0, h0);
  ecefToGeodetic(s1.pos, lat1, lon1, h1);
  double track = std::atan2(lon1 - lon0, lat1 - lat0) * 180.0 / consts::kPi;
  if (track < 0.0) track += 360.0;

  std::vector<unsigned char> packets;
  const int samples = d.samples;
  const int lineBytes = FbaqCodec::lineBytes(samples);
  std::vector<double> droop(static_cast<std::size_t>(samples));
  for (int k = 0; k < samples; ++k) droop[std::size_t(k)] = asarSimDroopGain(k);
  std::vector<fcomplex> block, scaled(static_cast<std::size_t>(samples));
  std::vector<unsigned char> head(kHead), data;
  std::uint32_t garbageState = 12345u;
  long records = 0;
  const int chunk = 256;
  for (int first = 0; first < d.lines; first += chunk) {
    const int count = std::min(chunk, d.lines - first);
    sim.renderLines(first, count, block);
    for (int i = first; i < first + count; ++i) {
      if (std::find(d.dropLines.begin(), d.dropLines.end(), i) == d.dropLines.end()) {
        const bool echo = asarLineIsEcho(cfg, i);
        int counter = cfg.firstLineCounter() + i;
        if (std::find(cfg.counterJumpLines.begin(), cfg.counterJumpLines.end(), i) != cfg.counterJumpLines.end())
          counter += 5000;
        const int pol = asarLinePolarisation(cfg, i);
        if (echo) {
          const fcomplex* row = block.data() + std::size_t(i - first) * std::size_t(samples);
          for (int k = 0; k < samples; ++k)
            scaled[std::size_t(k)] = row[k] * static_cast<float>(droop[std::size_t(k)]);
          data.assign(std::size_t(lineBytes), 0);
          FbaqCodec::encodeLine(scaled.data(), samples, data.data());
        } else {
          // Periodic calibration: four pulses of 64 8-bit I/Q samples.
          data.assign(4 * 2 * 64, 128);
        }
        const int cycle = cfg.imageMode() ? (counter - kImStart) % kImCycle
                                          : (counter - kApStart) % (2 * cfg.burstEchoes());
        const bool corrupt = std::find(d.corruptSwstLines.begin(), d.corruptSwstLines.end(), i) != d.corruptSwstLines.end();
        const int swst = sim.swstCodeOf(i) + (corrupt ? d.corruptSwstDelta : 0);
        std::fill(head.begin(), head.end(), 0);
        const mjd t = sec852mjd(sim.lineTime(i));
        asarPutBE32(head.data(), std::uint32_t(t.days));
        asarPutBE32(head.data() + 4, std::uint32_t(t.seconds));
        asarPutBE32(head.data() + 8, std::uint32_t(t.microseconds));
        asarPutBE16(head.data() + 32, 0x0800u | unsigned(m.applicationId));
        asarPutBE16(head.data() + 34, 0xC000u | unsigned(counter & 0x3FFF));
        asarPutBE16(head.data() + 36, unsigned(data.size() + kDataFieldHeader));
        asarPutBE16(head.data() + 38, kDataFieldHeader);
        head[41] = static_cast<unsigned char>(m.modeId);
        head[48] = static_cast<unsigned char>(counter >> 16);
        head[49] = static_cast<unsigned char>(counter >> 8);
        head[50] = static_cast<unsigned char>(counter);
        head[51] = static_cast<unsigned char>(cfg.swath << 2);
        head[52] = static_cast<unsigned char>((echo ? 0x80 : 0x30) | ((cycle >> 8) & 15));
        head[53] = static_cast<unsigned char>(cycle);
        asarPutBE16(head.data() + 54, unsigned(cfg.priCode));
        asarPutBE16(head.data() + 56, unsigned(swst));
        asarPutBE16(head.data() + 58, unsigned(samples));
        head[61] = static_cast<unsigned char>(m.polBits[pol] << 5);
        head[62] = static_cast<unsigned char>(cfg.pulseCode >> 2);
        head[63] = static_cast<unsigned char>((cfg.pulseCode & 3) << 6);
        head[64] = static_cast<unsigned char>(cfg.chirpCode);
        packets.insert(packets.end(), head.begin(), head.end());
        packets.insert(packets.end(), data.begin(), data.end());
        ++records;
      }
      for (const auto& [line, bytes] : cfg.garbage)
        if (line == i)
          for (int k = 0; k < bytes; ++k) {
            garbageState = garbageState * 1664525u + 1013904223u;
            packets.push_back(static_cast<unsigned char>(garbageState >> 24));
          }
    }
  }

  const std::string head0 = envisatMph(name, t1 + 3600.0, t0, t1) + level0Sph(cfg, m, lat0, lat1, track, records);
  {
    std::ofstream out(f.level0, std::ios::binary | std::ios::trunc);
    out.write(head0.data(), std::streamsize(head0.size()));
    out.write(reinterpret_cast<const char*>(packets.data()), std::streamsize(packets.size()));
    if (!out) {
      error = "cannot write " + f.level0;
      return 5;
    }
  }
  if (d.truncateImageBytes > 0) fs::resize_file(f.level0, std::uintmax_t(d.truncateImageBytes), ec);
  if (files) *files = f;
  if (int st = sim.writeTruth(outDir + "/truth.txt", error); st != 0 || cfg.imageMode()) return st;
  return appendBurstTruth(outDir + "/truth.txt", cfg, error);
}
