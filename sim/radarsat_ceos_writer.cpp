// RADARSAT-1 CEOS leader and signal data writers of the simulator.
#include "sim/radarsat_ceos_writer.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>

#include "base/constants.h"
#include "sim/ers_ceos_writer.h"

namespace {

constexpr double kC = consts::kSpeedOfLight;
constexpr double kPulse = 42.0e-6;
constexpr double kOffset = 4.2e-6;
constexpr double kCarrier = 5300432425.742575;  // c / 0.05656 m

struct SimBeam {
  const char* name;
  int code, pulses;
};
constexpr SimBeam kBeams[] = {{"S1", 1, 7},  {"S2", 2, 7},  {"S3", 3, 8},  {"S4", 4, 8},
                              {"S5", 5, 8},  {"S6", 6, 9},  {"S7", 7, 9},  {"F1", 16, 8},
                              {"F2", 17, 8}, {"F3", 18, 9}, {"F4", 19, 9}, {"F5", 20, 9}};
// Six ADC periods and one ADC period of each rate code, s.
constexpr double kUnits[3][2] = {{1.8566e-07, 3.094e-08}, {3.2491e-07, 5.415e-08}, {4.6415e-07, 7.736e-08}};
// Replica window of 44.559 us at the ADC clock of each rate code (129.2683 MHz
// over 4, 7 and 10), in complex samples; the 42 us chirp is centred in it.
constexpr int kReplicaWindows[3] = {1440, 822, 576};
constexpr double kBandwidths[3] = {30.0e6, 17.28e6, 11.58e6};

const unsigned char kTypeFdr[4] = {0x3F, 0xC0, 0x12, 0x12};
const unsigned char kTypeDss[4] = {0x12, 0x0A, 0x12, 0x14};
const unsigned char kTypePpr[4] = {0x12, 0x1E, 0x12, 0x14};
const unsigned char kTypeSignal[4] = {0x32, 0x0B, 0x12, 0x14};
constexpr int kDescriptor = 16252;
constexpr int kHead = 192;
constexpr int kAux = 50;

std::vector<int> parseList(const std::string& text) {
  std::vector<int> out;
  std::istringstream in(text);
  std::string item;
  while (in >> item) {
    const auto dash = item.find('-', 1);
    if (dash == std::string::npos) {
      out.push_back(std::stoi(item));
    } else {
      for (int k = std::stoi(item.substr(0, dash)); k <= std::stoi(item.substr(dash + 1)); ++k) out.push_back(k);
    }
  }
  return out;
}

// Nearest 4-bit level: v stands for v + 0.5.
int level4(float x) { return static_cast<int>(std::clamp(std::floor(x), -8.0f, 7.0f)); }

}  // namespace

bool RadarsatOptions::fromIni(const SimIni& ini, RadarsatOptions& o, std::string& error) {
  try {
    o.beam = ini.getString("Radarsat", "beam", o.beam);
    o.waveform = ini.getInt("Radarsat", "waveform", o.waveform);
    o.rateCode = ini.getInt("Radarsat", "rate_code", o.rateCode);
    o.priCode = ini.getInt("Radarsat", "pri_code", o.priCode);
    o.windowCode = ini.getInt("Radarsat", "window_code", o.windowCode);
    o.gainCode = ini.getInt("Radarsat", "gain_code", o.gainCode);
    o.replicaEvery = ini.getInt("Radarsat", "replica_every", o.replicaEvery);
    o.windowChangeLine = ini.getInt("Radarsat", "window_change_line", o.windowChangeLine);
    o.windowChangeCodes = ini.getInt("Radarsat", "window_change_codes", o.windowChangeCodes);
    o.gainChangeLine = ini.getInt("Radarsat", "gain_change_line", o.gainChangeLine);
    o.gainChangeDb = ini.getInt("Radarsat", "gain_change_db", o.gainChangeDb);
    o.scale = ini.getDouble("Radarsat", "scale", o.scale);
    o.layout = ini.getString("Radarsat", "layout", o.layout);
    o.badBeamCode = ini.getInt("Radarsat", "bad_beam_code", o.badBeamCode);
    o.damagedHeadLine = ini.getInt("Radarsat", "damaged_head_line", o.damagedHeadLine);
    o.dropLines = parseList(ini.getString("Radarsat", "drop_lines", ""));
    o.truncateBytes = std::stoll(ini.getString("Radarsat", "truncate_bytes", "0"));
  } catch (const std::exception& ex) {
    error = std::string("bad value in [Radarsat]: ") + ex.what();
    return false;
  }
  if (o.layout != "public" && o.layout != "table") {
    error = "[Radarsat] layout must be public or table, not " + o.layout;
    return false;
  }
  return true;
}

SceneDescription RadarsatSceneWriter::adjusted(SceneDescription d, RadarsatOptions& o, int& beamCode, int& pulses,
                                               double& unit, int& replicaSamples) {
  const auto beam = std::find_if(std::begin(kBeams), std::end(kBeams),
                                 [&o](const SimBeam& b) { return o.beam == b.name; });
  if (beam == std::end(kBeams)) throw std::runtime_error("beam must be one of S1..S7, F1..F5, not " + o.beam);
  if (o.rateCode < 0 || o.rateCode > 2 || o.waveform < 0 || o.waveform > 2)
    throw std::runtime_error("rate code and waveform must be 0, 1 or 2");
  if (o.gainCode < 0 || o.gainCode + std::max(0, o.gainChangeDb) > 63 || o.gainCode + o.gainChangeDb < 0)
    throw std::runtime_error("gain codes must stay within 0..63");
  beamCode = beam->code;
  pulses = beam->pulses;
  unit = kUnits[o.rateCode][0];
  d.mission = "RSAT1";
  d.carrierHz = kCarrier;
  d.samplingRateHz = 1.0 / kUnits[o.rateCode][1];
  d.pulseLength = kPulse;
  d.chirpCoefficient = kBandwidths[o.waveform] / kPulse / 2.0;
  if (o.priCode <= 0) o.priCode = static_cast<int>(std::lround(1.0 / (d.prfHz * unit))) - 2;
  if (o.priCode < 1 || o.priCode > 8191) throw std::runtime_error("PRI code outside 1..8191");
  const double pri = (o.priCode + 2.0) * unit;
  d.prfHz = 1.0 / pri;
  d.samples = 6 * ((d.samples + 5) / 6);
  if (d.samples / 6 - 1 > 4095) throw std::runtime_error("too many samples for the reception duration code");
  if (o.windowCode < 0)
    o.windowCode = static_cast<int>(std::lround((d.nearRangeTime + kOffset - pulses * pri) / unit)) - 5;
  if (o.windowCode < 0 || o.windowCode + std::max(0, o.windowChangeCodes) > 4095 ||
      o.windowCode + o.windowChangeCodes < 0)
    throw std::runtime_error("window codes must stay within 0..4095");
  d.lineWindowStarts.resize(std::size_t(d.lines));
  for (int k = 0; k < d.lines; ++k) {
    const int code = o.windowCode + (o.windowChangeLine >= 0 && k >= o.windowChangeLine ? o.windowChangeCodes : 0);
    d.lineWindowStarts[std::size_t(k)] = (code + 5) * unit - kOffset + pulses * pri;
  }
  d.nearRangeTime = d.lineWindowStarts.front();
  replicaSamples = kReplicaWindows[o.rateCode];
  return d;
}

RadarsatSceneWriter::RadarsatSceneWriter(SceneDescription scene, RadarsatOptions options)
    : opt_(std::move(options)),
      sim_(adjusted(std::move(scene), opt_, beamCode_, pulses_, unit_, replicaSamples_)) {}

int RadarsatSceneWriter::windowCodeOf(int line) const {
  return opt_.windowCode + (opt_.windowChangeLine >= 0 && line >= opt_.windowChangeLine ? opt_.windowChangeCodes : 0);
}

int RadarsatSceneWriter::gainCodeOf(int line) const {
  return opt_.gainCode + (opt_.gainChangeLine >= 0 && line >= opt_.gainChangeLine ? opt_.gainChangeDb : 0);
}

std::string RadarsatSceneWriter::leaderPath(const std::string& outDir) const {
  return outDir + "/" + sim_.scene().sceneDir + "/LEA_01.001";
}
std::string RadarsatSceneWriter::dataPath(const std::string& outDir) const {
  return outDir + "/" + sim_.scene().sceneDir + "/DAT_01.001";
}

void RadarsatSceneWriter::packAux(int line, bool replica, unsigned char* a) const {
  std::memset(a, 0, kAux);
  a[0] = 0x35, a[1] = 0x2E, a[2] = 0xF8, a[3] = 0x53;
  a[8] = 0x80;  // payload status: imaging
  a[12] = static_cast<unsigned char>(opt_.waveform << 4);
  const int beam = opt_.badBeamCode > 0 ? opt_.badBeamCode : beamCode_;
  a[18] = static_cast<unsigned char>(beam >> 8), a[19] = static_cast<unsigned char>(beam & 255);
  a[22] = static_cast<unsigned char>(opt_.rateCode << 4);
  a[25] = static_cast<unsigned char>(opt_.priCode >> 5), a[26] = static_cast<unsigned char>((opt_.priCode & 31) << 3);
  const int window = windowCodeOf(line);
  a[27] = static_cast<unsigned char>(window >> 4), a[28] = static_cast<unsigned char>((window & 15) << 4);
  const int rx = sim_.scene().samples / 6 - 1;
  a[29] = static_cast<unsigned char>(rx >> 4), a[30] = static_cast<unsigned char>((rx & 15) << 4);
  // Time of the line: day of the year, seconds, milliseconds, 1/1024 ms.
  const double t = sim_.lineTime(line);
  const CivilTime c = simCivil(t);
  const int doy = simDayOfYear(c.year, c.month, c.day);
  const double sod = t - simSec85(CivilTime{c.year, c.month, c.day, 0, 0, 0.0});
  int s = static_cast<int>(std::floor(sod));
  long sub = std::lround((sod - s) * 1024000.0);  // in 1/1024 ms
  if (sub >= 1024000) ++s, sub -= 1024000;
  const int ms = static_cast<int>(sub / 1024), frac = static_cast<int>(sub % 1024);
  a[43] = static_cast<unsigned char>(doy >> 3);
  a[44] = static_cast<unsigned char>(((doy & 7) << 5) | ((s >> 12) & 31));
  a[45] = static_cast<unsigned char>((s >> 4) & 255);
  a[46] = static_cast<unsigned char>(((s & 15) << 4) | (ms >> 6));
  a[47] = static_cast<unsigned char>(((ms & 63) << 2) | (frac >> 8));
  a[48] = static_cast<unsigned char>(frac & 255);
  a[49] = static_cast<unsigned char>((replica ? 0x40 : 0) | (gainCodeOf(line) & 63));
}

std::vector<char> RadarsatSceneWriter::buildLeader(bool slc, bool timeDecreasing) const {
  const SceneDescription& d = sim_.scene();
  const double duration = d.lines / d.prfHz;
  const double interval = 8.0;
  const double t0 = std::floor(d.startTime - 30.0);
  const int n = static_cast<int>(std::ceil((duration + 60.0) / interval)) + 1;
  const int pprLength = 386 + 132 * n;
  std::vector<char> b(std::size_t(720 + 4096 + pprLength), ' ');
  char* r = b.data();
  putCeosRecordHead(r, 1, kTypeFdr, 720);
  putText(r, 16, 12, "CEOS-SAR-CCT");
  putText(r, 48, 16, slc ? "RSAT-1-SAR-SLC" : "RSAT-1-SAR-RAW");
  r = b.data() + 720;
  putCeosRecordHead(r, 2, kTypeDss, 4096);
  if (slc) {
    putFormat(r, 710, 16, "%16.7f", d.samplingRateHz / 1.0e6);
    putFormat(r, 934, 16, "%16.7f", d.prfHz);
    putText(r, 1526, 8, "INCREASE");
    putText(r, 1534, 8, timeDecreasing ? "DECREASE" : "INCREASE");
  }
  putText(r, 20, 16, "SIM" + std::to_string(d.orbitNumber));
  putText(r, 68, 17, simCompactDateText(d.startTime + 0.5 * duration));
  putText(r, 100, 16, "DESCENDING");
  putInt(r, 444, 8, "%8ld", d.orbitNumber);
  r = b.data() + 4816;
  putCeosRecordHead(r, 3, kTypePpr, std::uint32_t(pprLength));
  const CivilTime c = simCivil(t0);
  putInt(r, 140, 4, "%4ld", n);
  putInt(r, 144, 4, "%4ld", c.year);
  putInt(r, 148, 4, "%4ld", c.month);
  putInt(r, 152, 4, "%4ld", c.day);
  putInt(r, 156, 4, "%4ld", simDayOfYear(c.year, c.month, c.day));
  putFormat(r, 160, 22, "%22.15E", t0 - simSec85(CivilTime{c.year, c.month, c.day, 0, 0, 0.0}));
  putFormat(r, 182, 22, "%22.15E", interval);
  putText(r, 204, 64, "EARTH CENTRED ROTATING");
  for (int k = 0; k < n; ++k) {
    const StateVector sv = sim_.orbit().at(t0 + k * interval);
    for (int j = 0; j < 3; ++j) {
      putFormat(r, 386 + 132 * k + 22 * j, 22, "%22.15E", sv.pos[std::size_t(j)]);
      putFormat(r, 386 + 132 * k + 66 + 22 * j, 22, "%22.15E", sv.vel[std::size_t(j)]);
    }
  }
  return b;
}

int RadarsatSceneWriter::write(const std::string& outDir, std::string& error) const {
  const SceneDescription& d = sim_.scene();
  const std::string dir = outDir + "/" + d.sceneDir;
  std::error_code ec;
  std::filesystem::create_directories(dir, ec);
  auto writeFile = [&error](const std::string& path, const std::vector<char>& bytes) {
    std::ofstream o(path, std::ios::binary);
    if (!o.write(bytes.data(), std::streamsize(bytes.size()))) {
      error = "cannot write " + path;
      return 5;
    }
    return 0;
  };
  if (int st = writeFile(leaderPath(outDir), buildLeader()); st != 0) return st;

  const bool table = opt_.layout == "table";
  const int slots = recordSlots();
  const int recordLength = kHead + kAux + 2 * slots;
  std::vector<bool> dropped(std::size_t(d.lines), false);
  for (int k : opt_.dropLines)
    if (k >= 0 && k < d.lines) dropped[std::size_t(k)] = true;
  const int records = d.lines - static_cast<int>(std::count(dropped.begin(), dropped.end(), true));
  std::vector<char> descriptor(kDescriptor, ' ');
  putCeosRecordHead(descriptor.data(), 1, kTypeFdr, kDescriptor);
  putText(descriptor.data(), 48, 16, "RSAT-1-SAR-RAW");
  putInt(descriptor.data(), 180, 6, "%6ld", records);
  putInt(descriptor.data(), 186, 6, "%6ld", recordLength);
  const std::string path = dataPath(outDir);
  std::ofstream o(path, std::ios::binary);
  if (!o.write(descriptor.data(), kDescriptor)) {
    error = "cannot write " + path;
    return 5;
  }

  // The replica as the instrument loops it back: the 42 us chirp centred in
  // the replica window, the smallest levels of either sign around it.
  const double K = 2.0 * d.chirpCoefficient, fs = d.samplingRateHz;
  const int pulse = pulseSamples();
  const int lead = (replicaSamples_ - pulse) / 2;
  std::vector<unsigned char> replica(2 * std::size_t(replicaSamples_));
  auto code = [table](int v) { return static_cast<unsigned char>(table ? v + 16 : (v & 0x0F)); };
  for (int j = 0; j < replicaSamples_; ++j) {
    float re = (j & 1) ? 0.0f : -1.0f, im = (j & 2) ? 0.0f : -1.0f;
    if (j >= lead && j < lead + pulse) {
      const double u = (j - lead - 0.5 * (pulse - 1)) / fs;
      const double ph = consts::kPi * K * u * u;
      re = static_cast<float>(6.0 * std::cos(ph));
      im = static_cast<float>(6.0 * std::sin(ph));
    }
    replica[2 * std::size_t(j)] = code(level4(re));
    replica[2 * std::size_t(j) + 1] = code(level4(im));
  }
  std::vector<char> rec(static_cast<std::size_t>(recordLength));
  std::vector<fcomplex> echoes;
  const int block = 256;
  std::uint32_t sequence = 2;
  for (int first = 0; first < d.lines; first += block) {
    const int count = std::min(block, d.lines - first);
    sim_.renderLines(first, count, echoes);
    for (int k = 0; k < count; ++k) {
      const int line = first + k;
      if (dropped[std::size_t(line)]) continue;
      std::fill(rec.begin(), rec.end(), 0);
      putCeosRecordHead(rec.data(), sequence++, kTypeSignal, std::uint32_t(recordLength));
      if (line == opt_.damagedHeadLine) std::memset(rec.data() + 4, 0, 4);
      putBE32(rec.data() + 12, std::uint32_t(line + 1));
      const bool hasReplica = line == 0 || (opt_.replicaEvery > 0 && line % opt_.replicaEvery == 0);
      auto* aux = reinterpret_cast<unsigned char*>(rec.data() + kHead);
      packAux(line, hasReplica, aux);
      if (table) {
        std::memmove(aux, aux + 12, kAux - 12);
        std::memset(aux + kAux - 12, 0, 12);
      }
      auto* px = reinterpret_cast<unsigned char*>(rec.data() + kHead + kAux);
      if (hasReplica) {
        std::copy(replica.begin(), replica.end(), px);
        px += replica.size();
      }
      const float g = static_cast<float>(opt_.scale * std::pow(10.0, -(gainCodeOf(line) - opt_.gainCode) / 20.0));
      const fcomplex* e = echoes.data() + std::size_t(k) * std::size_t(d.samples);
      for (int j = 0; j < d.samples; ++j) {
        px[2 * j] = code(level4(g * e[j].real()));
        px[2 * j + 1] = code(level4(g * e[j].imag()));
      }
      if (!o.write(rec.data(), recordLength)) {
        error = "cannot write " + path;
        return 5;
      }
    }
  }
  o.close();
  if (opt_.truncateBytes > 0) std::filesystem::resize_file(path, std::uintmax_t(opt_.truncateBytes), ec);
  return sim_.writeTruth(outDir + "/truth.txt", error);
}

int RadarsatSceneWriter::writeSlc(const std::string& outDir, bool timeDecreasing, std::string& error) const {
  const SceneDescription& d = sim_.scene();
  std::error_code ec;
  std::filesystem::create_directories(outDir + "/" + d.sceneDir, ec);
  const std::vector<char> leader = buildLeader(true, timeDecreasing);
  std::ofstream l(leaderPath(outDir), std::ios::binary);
  if (!l.write(leader.data(), std::streamsize(leader.size()))) {
    error = "cannot write " + leaderPath(outDir);
    return 5;
  }
  const int recordLength = kHead + 4 * d.samples;
  std::vector<char> descriptor(kDescriptor, ' ');
  putCeosRecordHead(descriptor.data(), 1, kTypeFdr, kDescriptor);
  putText(descriptor.data(), 48, 16, "RSAT-1-SAR-SLC");
  putInt(descriptor.data(), 180, 6, "%6ld", d.lines);
  putInt(descriptor.data(), 186, 6, "%6ld", recordLength);
  const std::string path = dataPath(outDir);
  std::ofstream o(path, std::ios::binary);
  o.write(descriptor.data(), kDescriptor);
  std::vector<char> rec(static_cast<std::size_t>(recordLength));
  for (int k = 0; k < d.lines; ++k) {
    const int line = timeDecreasing ? d.lines - 1 - k : k;
    std::fill(rec.begin(), rec.end(), 0);
    putCeosRecordHead(rec.data(), std::uint32_t(k + 2), kTypeSignal, std::uint32_t(recordLength));
    putBE32(rec.data() + 12, std::uint32_t(k + 1));
    const double t = sim_.lineTime(line);
    const CivilTime c = simCivil(t);
    putBE32(rec.data() + 36, std::uint32_t(c.year));
    putBE32(rec.data() + 40, std::uint32_t(simDayOfYear(c.year, c.month, c.day)));
    putBE32(rec.data() + 44,
            std::uint32_t(std::lround(1000.0 * (t - simSec85(CivilTime{c.year, c.month, c.day, 0, 0, 0.0})))));
    putBE32(rec.data() + 64, std::uint32_t(std::lround(0.5 * kC * d.nearRangeTime)));
    for (int j = 0; j < d.samples; ++j) {
      int i = 0, q = 0;
      slcPixel(line, j, i, q);
      char* px = rec.data() + kHead + 4 * j;
      px[0] = char((i >> 8) & 255), px[1] = char(i & 255), px[2] = char((q >> 8) & 255), px[3] = char(q & 255);
    }
    o.write(rec.data(), recordLength);
  }
  if (!o) {
    error = "cannot write " + path;
    return 5;
  }
  return 0;
}

int RadarsatSceneWriter::writeTextOrbit(const std::string& path, std::string& error) const {
  const SceneDescription& d = sim_.scene();
  const CivilTime c = simCivil(d.startTime);
  const double midnight = simSec85(CivilTime{c.year, c.month, c.day, 0, 0, 0.0});
  const int doy = simDayOfYear(c.year, c.month, c.day);
  const double g0 = 100.375;  // degrees at midnight: any value, the file carries it
  const double w = 7.292115189334571e-5;
  auto stamp = [&](double t) {
    const double sod = t - midnight;
    const int h = static_cast<int>(sod / 3600.0), m = static_cast<int>((sod - 3600.0 * h) / 60.0);
    char text[64];
    std::snprintf(text, sizeof text, "%04d %03d %02d:%02d:%09.6f", c.year, doy, h, m, sod - 3600.0 * h - 60.0 * m);
    return std::string(text);
  };
  std::ostringstream o;
  o << "RADARSAT-1 DEFINITIVE ORBIT\nGENERATION TIME: " << stamp(midnight + 3600.0) << "\nORBIT NUMBER: "
    << d.orbitNumber << "\nGREENWICH ANGLE: " << stamp(midnight) << " " << g0
    << "\nFIRST MODEL: GEOPOTENTIAL 70X70\nSECOND MODEL: DRAG\n";
  const double first = std::floor(d.startTime / 60.0) * 60.0 - 600.0;
  const double last = d.startTime + d.lines / d.prfHz + 600.0;
  for (double t = first; t <= last; t += 60.0) {
    const StateVector sv = sim_.orbit().at(t);
    const double g = g0 * consts::kPi / 180.0 + w * (t - midnight), cg = std::cos(g), sg = std::sin(g);
    const double px = sv.pos[0], py = sv.pos[1];
    const double ux = sv.vel[0] - w * py, uy = sv.vel[1] + w * px;
    char line[256];
    std::snprintf(line, sizeof line, "STATE VECTOR: %s %.6f %.6f %.6f %.9f %.9f %.9f\n", stamp(t).c_str(),
                  cg * px - sg * py, sg * px + cg * py, sv.pos[2], cg * ux - sg * uy, sg * ux + cg * uy, sv.vel[2]);
    o << line;
  }
  std::ofstream f(path);
  if (!(f << o.str())) {
    error = "cannot write " + path;
    return 5;
  }
  return 0;
}
