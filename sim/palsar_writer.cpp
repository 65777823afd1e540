// ALOS PALSAR level-1.0 products of the simulator.
#include "sim/palsar_writer.h"

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
#include "ingest/palsar/palsar_ceos_layout.h"
#include "sim/ers_ceos_writer.h"

namespace {

constexpr double kC = consts::kSpeedOfLight;
constexpr double kWavelength = 0.2361;
constexpr double kPulse = 27e-6;
constexpr int kLeaderFd = 720, kDssLength = 4096, kPprLength = 4680, kVectors = 28;
constexpr int kLeaderLength = 20000;
constexpr double kInterferenceBins = 256.0;

namespace dss = palsar_leader::dss;
namespace desc = palsar_image::descriptor;
namespace sig = palsar_image::signal;

const char* const kLabels[4] = {"HH", "HV", "VH", "VV"};
// Transmit and receive codes of each polarisation (0 H, 1 V).
constexpr int kTx[4] = {0, 0, 1, 1}, kRx[4] = {0, 1, 0, 1};

void putF16(char* r, CeosField field, double v) { putFormat(r, field, "%16.7f", v); }

struct PalCivilTime {
  int year = 0, month = 0, day = 0, doy = 0;
  double secondsOfDay = 0.0;
};
PalCivilTime civil(double t) {
  static const char* kMonths = "JANFEBMARAPRMAYJUNJULAUGSEPOCTNOVDEC";
  std::string text;
  sec852ascii(t, text);  // "DD-MMM-YYYY hh:mm:ss.ffffff"
  PalCivilTime c;
  c.day = std::atoi(text.substr(0, 2).c_str());
  c.month = static_cast<int>(std::string(kMonths).find(text.substr(3, 3)) / 3) + 1;
  c.year = std::atoi(text.substr(7, 4).c_str());
  const double dayStart = ascii2sec85(text.substr(0, 11) + " 00:00:00.000000");
  const double yearStart = ascii2sec85("01-JAN-" + text.substr(7, 4) + " 00:00:00.000000");
  c.doy = static_cast<int>(std::lround((dayStart - yearStart) / 86400.0)) + 1;
  c.secondsOfDay = t - dayStart;
  return c;
}

std::vector<char> buildLeader(const RawSceneSimulator& sim, const PalsarSimConfig& cfg) {
  const SceneDescription& d = sim.scene();
  std::vector<char> L(kLeaderLength, ' ');
  char* r = L.data();
  const unsigned char fdType[4] = {11, 192, 18, 18}, dssType[4] = {18, 10, 18, 20}, pprType[4] = {18, 30, 18, 20},
                      facType[4] = {18, 200, 18, 50};
  putCeosRecordHead(r, 1, fdType, kLeaderFd);
  putText(r, 12, 4, "A");
  putText(r, 16, 12, "CEOS-SAR-CCT");
  putText(r, 48, 16, "LED-SIMPALSAR");
  char* s = r + kLeaderFd;
  putCeosRecordHead(s, 2, dssType, kDssLength);

  const int channels = cfg.channels();
  const bool plr = cfg.mode == "PLR";
  const double t0 = d.startTime, t1 = sim.lineTime(d.lines - 1);
  const Vec3 p0 = sim.orbit().at(t0).pos, p1 = sim.orbit().at(t1).pos;
  const bool ascending = p1[2] > p0[2];
  putText(s, dss::kSceneId, "ALPSRP" + std::to_string(d.orbitNumber) + "0" + std::to_string(d.frame));
  putInt(s, dss::kChannelCount, "%4ld", channels);
  std::string sensor = "ALOS -L -1.0";
  sensor += plr ? "62" : "60";
  sensor += std::string("-") + (channels == 1 ? "HH" : channels == 2 ? "DP" : "QP");
  putText(s, dss::kSensorId, sensor);
  putFormat(r, 1028, 16, "%16.7f", 8.9);
  putInt(s, dss::kOrbitNumber, "%8ld", d.orbitNumber);
  double lat0, lon0, h0, lat1, lon1, h1;
  ecefToGeodetic(p0, lat0, lon0, h0);
  ecefToGeodetic(p1, lat1, lon1, h1);
  double heading = std::atan2(lon1 - lon0, lat1 - lat0) * 180.0 / consts::kPi;
  if (heading < 0.0) heading += 360.0;
  putFormat(s, dss::kHeading, "%8.3f", heading);
  putF16(s, dss::kWavelength, sim.wavelength());
  putFormat(r, 1238, 16, "%16.7f", 1.0);
  const double bandwidth = std::fabs(2.0 * d.chirpCoefficient * d.pulseLength);
  putFormat(s, dss::kChirpSlope, "%16.8E", bandwidth / d.pulseLength);
  putFormat(s, dss::kChirpSlopeSecond, "%16.8E", 0.0);
  putInt(s, dss::kMaxMissingLines, "%8ld", cfg.maxMissingLines);
  putF16(s, dss::kSamplingRateMHz, d.samplingRateHz / 1e6);
  putF16(s, dss::kWindowStartUs, sim.swst() * 1e6);
  putF16(s, dss::kPulseLengthUs, d.pulseLength * 1e6);
  putF16(s, dss::kGainHDb, 0.0);
  putF16(s, dss::kGainVDb, 0.0);
  putInt(r, 1518, 8, "%8ld", 0);
  putF16(s, dss::kBiasI, 15.5);
  putF16(s, dss::kBiasQ, 15.5);
  // Polarimetric leaders carry twice the PRF: H and V transmissions alternate.
  putF16(s, dss::kPrfMilliHz, d.prfHz * 1000.0 * (plr ? 2.0 : 1.0));
  putText(s, dss::kStation, cfg.ersdac() ? "ERSDAC-SIM" : "SIM-STATION");
  const PalCivilTime c0 = civil(t0);
  char date[16];
  std::snprintf(date, sizeof date, "%04d%02d%02d", c0.year, c0.month, c0.day);
  putText(s, dss::kAcquisitionDate, date);
  putText(s, dss::kProcessingLevel, "UNPROCESSED");
  putText(s, dss::kDirection, ascending ? "A" : "D");
  putText(s, dss::kErsdacDirection, ascending ? "A" : "D");
  putText(s, dss::kChirpDigits, "   0");
  putInt(s, dss::kBeamNumber, "%4ld", cfg.beam);
  if (cfg.ersdac()) putText(s, dss::kErsdacFacility, "VEXCEL");

  // Platform position record: vectors 60 s apart around the scene.
  char* p = r + kLeaderFd + kDssLength;
  putCeosRecordHead(p, 3, pprType, kPprLength);
  const double first = std::floor(t0 / 60.0) * 60.0 - 12 * 60.0;
  const PalCivilTime cv = civil(first);
  putInt(p, 140, 4, "%4ld", kVectors);
  putInt(p, 144, 4, "%4ld", cv.year);
  putInt(p, 148, 4, "%4ld", cv.month);
  putInt(p, 152, 4, "%4ld", cv.day);
  putInt(p, 156, 4, "%4ld", cv.doy);
  putFormat(p, 160, 22, "%22.6f", cv.secondsOfDay);
  putFormat(p, 182, 22, "%22.6f", 60.0);
  for (int i = 0; i < kVectors; ++i) {
    const StateVector sv = sim.orbit().at(first + 60.0 * i);
    const double pos[3] = {sv.pos[0], sv.pos[1], sv.pos[2]}, vel[3] = {sv.vel[0], sv.vel[1], sv.vel[2]};
    for (int k = 0; k < 3; ++k) {
      putFormat(p, 386 + 132 * i + 22 * k, 22, "%22.6f", pos[k]);
      putFormat(p, 386 + 132 * i + 66 + 22 * k, 22, "%22.9f", vel[k]);
    }
  }
  putText(p, 4082, 1, "0");
  char* f = p + kPprLength;
  putCeosRecordHead(f, 4, facType, kLeaderLength - (kLeaderFd + kDssLength + kPprLength));
  putText(r, 17747, 1, "0");
  return L;
}

std::vector<char> buildImageDescriptor(const PalsarSimConfig& cfg, int records, int recordLength, int samples) {
  const int size = cfg.ersdac() ? kPalsarErsdacImageStart : kPalsarJaxaImageStart;
  std::vector<char> D(std::size_t(size), ' ');
  char* r = D.data();
  const unsigned char type[4] = {63, 192, 18, 18};
  putCeosRecordHead(r, 1, type, std::uint32_t(size));
  putText(r, 12, 4, "A");
  putText(r, 16, 12, "CEOS-SAR-CCT");
  putText(r, 48, 16, "IMG-SIMPALSAR");
  putInt(r, desc::kRecordCount, "%6ld", records);
  putInt(r, desc::kRecordLength, "%6ld", recordLength);
  // ERSDAC counts the product's channels as 1, 3 (dual) or 6 (quad).
  const int channels = cfg.ersdac() ? (cfg.channels() == 1 ? 1 : cfg.channels() == 2 ? 3 : 6) : 1;
  putInt(r, desc::kChannels, "%4ld", channels);
  putInt(r, desc::kSignalRecords, "%8ld", records);
  putInt(r, desc::kPixels, "%8ld", samples);
  return D;
}

// Tones and the bursts of a line, with a phase that changes from line to line;
// a burst is a tone at 0.17 fs on its line.
void addInterference(const PalsarSimConfig& cfg, int line, double clutterPower, double fs, fcomplex* row, int samples) {
  auto add = [&](double freq, double db, double phase0) {
    // Power over the clutter's power in a range-frequency bin of a 256-bin
    // spectrum of the line, whatever the line's length.
    const double a = std::sqrt(clutterPower * std::pow(10.0, db / 10.0) / kInterferenceBins);
    for (int j = 0; j < samples; ++j) {
      const double phase = 2.0 * consts::kPi * freq * j / fs + phase0;
      row[j] += fcomplex(static_cast<float>(a * std::cos(phase)), static_cast<float>(a * std::sin(phase)));
    }
  };
  for (std::size_t k = 0; k < cfg.tones.size(); ++k) add(cfg.tones[k].first, cfg.tones[k].second, 1.3 * line + 0.7 * double(k));
  for (const auto& [burstLine, db] : cfg.bursts)
    if (burstLine == line) add(0.17 * fs, db, 0.4);
}

}  // namespace

bool PalsarSimConfig::fromIni(const SimIni& ini, PalsarSimConfig& c, std::string& error) {
  c = PalsarSimConfig{};
  c.layout = ini.getString("PALSAR", "layout", c.layout);
  c.mode = ini.getString("PALSAR", "mode", c.mode);
  c.maxMissingLines = ini.getInt("PALSAR", "max_missing_lines", c.maxMissingLines);
  c.beam = ini.getInt("PALSAR", "beam", c.beam);
  c.offNadirDeg = ini.getDouble("PALSAR", "off_nadir_deg", c.offNadirDeg);
  std::istringstream tones(ini.getString("PALSAR", "tones", "")), bursts(ini.getString("PALSAR", "bursts", ""));
  std::string item;
  while (tones >> item) {
    const auto colon = item.find(':');
    if (colon == std::string::npos) {
      error = "[PALSAR] tones: expected freq_hz:db, not " + item;
      return false;
    }
    c.tones.emplace_back(std::stod(item.substr(0, colon)), std::stod(item.substr(colon + 1)));
  }
  while (bursts >> item) {
    const auto colon = item.find(':');
    if (colon == std::string::npos) {
      error = "[PALSAR] bursts: expected line:db, not " + item;
      return false;
    }
    c.bursts.emplace_back(std::stoi(item.substr(0, colon)), std::stod(item.substr(colon + 1)));
  }
  if (c.layout != "JAXA" && c.layout != "ERSDAC") {
    error = "[PALSAR] layout must be JAXA or ERSDAC, not " + c.layout;
    return false;
  }
  if (c.mode != "FBS" && c.mode != "FBD" && c.mode != "PLR") {
    error = "[PALSAR] mode must be FBS, FBD or PLR, not " + c.mode;
    return false;
  }
  if (c.maxMissingLines < 0) {
    error = "[PALSAR] max_missing_lines must not be negative";
    return false;
  }
  return true;
}

void applyPalsarInstrument(const PalsarSimConfig& cfg, SceneDescription& s) {
  const bool fine = cfg.mode == "FBS";  // FBD and PLR use the 14 MHz chirp
  s.mission = "PALSAR";
  s.carrierHz = kC / kWavelength;
  s.samplingRateHz = fine ? 32e6 : 16e6;
  s.pulseLength = kPulse;
  const double bandwidth = fine ? 28e6 : 14e6;
  // Down-chirp: the frequency falls over the pulse.
  s.chirpCoefficient = -bandwidth / (2.0 * kPulse);
  s.antennaLength = 8.9;
  // Window codes count whole metres of slant range above a round offset
  // 30 km below the wanted near range, as the line prefixes record it.
  s.swstStep = 2.0 / kC;
  s.swstOffset = 2.0 * (std::floor(s.nearRangeTime * kC / 2000.0) * 1000.0 - 30000.0) / kC;
  s.orbit.semiMajorAxis = 6378137.0 + 691650.0;
  s.orbit.eccentricity = 0.0001;
  s.orbit.inclinationDeg = 98.16;
}

int writePalsarScene(const SceneDescription& scene, const PalsarSimConfig& cfg, const std::string& outDir,
                     PalsarSceneFiles* files, std::string& error) {
  namespace fs = std::filesystem;
  std::error_code ec;
  fs::create_directories(outDir, ec);
  const int channels = cfg.channels();
  const bool plr = cfg.mode == "PLR", ersdac = cfg.ersdac();
  const std::string id = "ALPSRP" + std::to_string(scene.orbitNumber) + "0" + std::to_string(scene.frame);
  PalsarSceneFiles out;
  out.leader = outDir + "/LED-" + id + "-H1.0__A";
  try {
    std::vector<RawSceneSimulator> sims;
    for (int ch = 0; ch < channels; ++ch) {
      SceneDescription d = scene;
      const double k = cfg.channelScale[std::size_t(ch)];
      for (SimTarget& t : d.targets) t.amplitude *= k;
      for (SimPixelTarget& t : d.pixelTargets) t.amplitude *= k;
      d.clutterSigma *= k;
      d.seed = scene.seed + 7919u * std::uint64_t(ch);
      // Polarimetric products alternate H and V transmissions: the V-transmit
      // echoes are received half a pulse interval of a channel after the
      // H-transmit ones. Their records carry the time of the pair's H line.
      // Targets given by line keep their place on the ground.
      if (plr && kTx[ch] == 1) {
        d.startTime += 0.5 / scene.prfHz;
        for (SimPixelTarget& t : d.pixelTargets) t.line -= 0.5;
      }
      sims.emplace_back(d);
    }
    const RawSceneSimulator& sim0 = sims.front();
    const SceneDescription& d = sim0.scene();
    {
      const std::vector<char> leader = buildLeader(sim0, cfg);
      std::ofstream o(out.leader, std::ios::binary | std::ios::trunc);
      o.write(leader.data(), std::streamsize(leader.size()));
      if (!o) {
        error = "cannot write " + out.leader;
        return 5;
      }
    }
    const int prefix = ersdac ? kPalsarErsdacPrefix : kPalsarJaxaPrefix;
    const int recordLength = prefix + 2 * d.samples;
    std::vector<bool> dropped(std::size_t(d.lines), false);
    for (int line : d.dropLines)
      if (line >= 0 && line < d.lines) dropped[std::size_t(line)] = true;
    const int records = d.lines - static_cast<int>(std::count(dropped.begin(), dropped.end(), true));
    const unsigned char type[4] = {50, 10, 18, 20};
    for (int ch = 0; ch < channels; ++ch) {
      const std::string name = outDir + "/IMG-" + kLabels[ch] + "-" + id + "-H1.0__A";
      std::ofstream o(name, std::ios::binary | std::ios::trunc);
      const std::vector<char> head = buildImageDescriptor(cfg, records, recordLength, d.samples);
      o.write(head.data(), std::streamsize(head.size()));
      std::vector<fcomplex> block;
      std::vector<char> rec(static_cast<std::size_t>(recordLength));
      std::vector<unsigned char> iq(2 * std::size_t(d.samples));
      std::uint32_t sequence = 2;
      const int chunk = 256;
      const double clutterPower = 2.0 * sims[std::size_t(ch)].scene().clutterSigma * sims[std::size_t(ch)].scene().clutterSigma;
      for (int first = 0; first < d.lines; first += chunk) {
        const int count = std::min(chunk, d.lines - first);
        sims[std::size_t(ch)].renderLines(first, count, block);
        for (int i = first; i < first + count; ++i)
          addInterference(cfg, i, clutterPower, d.samplingRateHz, block.data() + std::size_t(i - first) * std::size_t(d.samples),
                          d.samples);
        for (int i = first; i < first + count; ++i) {
          if (dropped[std::size_t(i)]) continue;
          std::fill(rec.begin(), rec.end(), 0);
          char* r = rec.data();
          putCeosRecordHead(r, sequence++, type, std::uint32_t(recordLength));
          putBE32(r + sig::kLineNumber.offset, std::uint32_t(i + 1));
          putBE32(r + sig::kPixels.offset, std::uint32_t(d.samples));
          const PalCivilTime c = civil(sim0.lineTime(i));
          putBE32(r + sig::kYear.offset, std::uint32_t(c.year));
          putBE32(r + sig::kDayOfYear.offset, std::uint32_t(c.doy));
          putBE32(r + sig::kMillisecond.offset, std::uint32_t(std::lround(c.secondsOfDay * 1000.0)));
          putBE16(r + sig::kTransmit.offset, std::uint16_t(kTx[ch]));
          putBE16(r + sig::kReceive.offset, std::uint16_t(kRx[ch]));
          putBE32(r + sig::kPrfMilliHz.offset, std::uint32_t(std::lround(d.prfHz * 1000.0 * (plr ? 2.0 : 1.0))));
          putBE32(r + sig::kScanId.offset, 1u);
          const double nearM = std::round(sim0.swstSeconds(sim0.swstCodeOf(i)) * kC / 2.0);
          putBE32(r + sig::kNearRangeM.offset, std::uint32_t(std::lround(nearM)));
          putBE32(r + sig::kFarRangeM.offset, std::uint32_t(std::lround(nearM + (d.samples - 1) * kC / (2.0 * d.samplingRateHz))));
          // Instrument prefix: bit 2 of its byte 60 marks the 14 MHz chirp.
          if (!ersdac && cfg.mode != "FBS") r[sig::kChirpSelect.offset] = sig::kNarrowChirpBit;
          sims[std::size_t(ch)].quantiseLine(block.data() + std::size_t(i - first) * std::size_t(d.samples), iq.data());
          std::memcpy(r + prefix, iq.data(), iq.size());
          o.write(rec.data(), std::streamsize(rec.size()));
        }
      }
      if (!o) {
        error = "cannot write " + name;
        return 5;
      }
      o.close();
      if (d.truncateImageBytes > 0) fs::resize_file(name, std::uintmax_t(d.truncateImageBytes), ec);
      out.images.push_back(name);
      out.labels.push_back(kLabels[ch]);
    }
    if (files) *files = out;
    return sim0.writeTruth(outDir + "/truth.txt", error);
  } catch (const std::exception& ex) {
    error = ex.what();
    return 5;
  }
}
