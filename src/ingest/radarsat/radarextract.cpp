// RADARSAT-1 CEOS raw extraction.
#include "ingest/radarsat/radarextract.h"

#include <algorithm>
#include <climits>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <fstream>
#include <istream>
#include <vector>
#include <new>

#include "base/constants.h"
#include "base/status.h"
#include "diag/ckerr.h"
#include "diag/report.h"
#include "diag/waitbar.h"
#include "ingest/ceos/ceos_fields.h"
#include "ingest/radarsat/radarextract_params.h"
#include "ingest/radarsat/radarsat_format.h"
#include "orbit/general_sar_orbit.h"
#include "product/acquisition_objects.h"
#include "product/buffer_io.h"
#include "product/data_file.h"
#include "product/time_base.h"

namespace {

using namespace radarsat;

constexpr const char* kMonths[12] = {"JAN", "FEB", "MAR", "APR", "MAY", "JUN",
                                     "JUL", "AUG", "SEP", "OCT", "NOV", "DEC"};
// Leader: file descriptor 720, data set summary 4096, then the platform
// position record; products with the longer summary and facility records
// in front of it hold that record at 48002.
constexpr long kPositionRecord = 4816;
constexpr long kPositionRecordLong = 48002;
constexpr unsigned char kPositionType[4] = {0x12, 0x1E, 0x12, 0x14};
constexpr int kVectorBytes = 132;
constexpr double kEarthRotation = 7.292115189334571e-5;

int fail(const std::string& message, int status, int line, const char* function) {
  orv_add_report(message, REPORT_ERROR, line, function, __FILE__);
  return status;
}
#define RS_FAIL(message, status) fail((message), (status), __LINE__, __func__)
#define RS_CALLED(status) (ORV_REPORT_CALLED_ERROR(), (status))

std::string lineMessage(const char* format, int line) {
  char text[128];
  std::snprintf(text, sizeof text, format, line);
  return text;
}

// The fixed head of the next line record, and whether it is a signal record.
bool readSignalHead(std::istream& in, std::vector<unsigned char>& head) {
  return in.read(reinterpret_cast<char*>(head.data()), kLineHeadBytes) &&
         std::equal(kSignalRecordType.begin(), kSignalRecordType.end(), head.begin() + 4);
}

std::uint32_t be32(const unsigned char* p) {
  return (std::uint32_t(p[0]) << 24) | (std::uint32_t(p[1]) << 16) | (std::uint32_t(p[2]) << 8) |
         std::uint32_t(p[3]);
}

std::string trimmed(const std::string& s) {
  const auto first = s.find_first_not_of(' ');
  if (first == std::string::npos) return {};
  return s.substr(first, s.find_last_not_of(' ') - first + 1);
}

// Whole file in memory (leaders are small).
bool slurp(const std::string& path, std::vector<char>& bytes) {
  std::ifstream in(path, std::ios::binary);
  if (path.empty() || !in) return false;
  bytes.assign(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
  return true;
}

// A real of a leader field, with the exponent letter 'E' or the Fortran 'D';
// false for a blank or malformed field.
bool leaderReal(const std::vector<char>& b, long offset, int width, double& value) {
  if (offset < 0 || offset + width > static_cast<long>(b.size())) return false;
  std::string text(b.data() + offset, std::size_t(width));
  std::replace(text.begin(), text.end(), 'D', 'E');
  std::replace(text.begin(), text.end(), 'd', 'E');
  const std::string t = trimmed(text);
  if (t.empty()) return false;
  char* end = nullptr;
  value = std::strtod(t.c_str(), &end);
  return end != t.c_str() && *end == '\0';
}

long positionRecordOffset(const std::vector<char>& b) {
  auto isPosition = [&b](long at) {
    return at + 12 <= static_cast<long>(b.size()) && std::memcmp(b.data() + at + 4, kPositionType, 4) == 0;
  };
  if (isPosition(kPositionRecord)) return kPositionRecord;
  if (isPosition(kPositionRecordLong)) return kPositionRecordLong;
  return kPositionRecord;
}

// Greenwich mean sidereal angle (radians) at a time in seconds since 1985.
double greenwichAngle(double sec85) {
  const double d = sec85 / 86400.0 + 2446066.5 - 2451545.0;  // days from J2000.0
  const double deg = 280.46061837 + 360.98564736629 * d;
  return std::fmod(deg, 360.0) * consts::kPi / 180.0;
}

}  // namespace

int radarextract::readpar(const std::string& file) {
  radarextract_conf conf;
  radarextract_input input;
  radarextract_output output;
  conf.readpar(file);
  input.readpar(file);
  output.readpar(file);
  if (int st = conf.checkpar(); st != 0) return RS_CALLED(st);
  if (int st = input.checkpar(); st != 0) return RS_CALLED(st);
  if (int st = output.checkpar(); st != 0) return RS_CALLED(st);
  ReportFilename = conf.ReportFilename;
  LinesToSkip = input.LinesToSkip;
  LinesToExtract = input.LinesToExtract;
  LeaderFile = input.LeaderFile;
  DataFile = input.DataFile;
  OrbitFile = input.OrbitFile;
  OutputRawFile = output.OutputRawFile;
  OutputChirpFile = output.OutputChirpFile;
  return 0;
}

int radarextract::checkpar() const {
  radarextract_input input;
  input.LinesToSkip = LinesToSkip;
  input.LinesToExtract = LinesToExtract;
  input.LeaderFile = LeaderFile;
  input.DataFile = DataFile;
  radarextract_output output;
  output.OutputRawFile = OutputRawFile;
  if (int st = input.checkpar(); st != 0) return st;
  return output.checkpar();
}

int radarextract::run() {
  CheckedCall cc("radarextract::run()");
  const int level = checklevel();
  if (level != 0 && level != 1) return RS_CALLED(level);
  productLevel = level;
  const int st = level == 1 ? extractSLC() : RADARExtract();
  if (st != 0) return RS_CALLED(st);
  return 0;
}

int radarextract::checklevel() {
  std::ifstream in(LeaderFile, std::ios::binary);
  if (LeaderFile.empty() || !in) return RS_FAIL("File not opened! " + LeaderFile, STATUS_NOT_OPENED);
  char text[16];
  if (!in.seekg(48) || !in.read(text, 16)) return RS_FAIL("File reading failed! " + LeaderFile, STATUS_READ_FAILED);
  return std::strncmp(text, "RSAT-1-SAR-SLC", 14) == 0 ? 1 : 0;
}

int radarextract::getOrbitConf(const std::string& leader, DataSetInfo_Obj* info) {
  std::vector<char> b;
  if (!slurp(leader, b)) return RS_FAIL("File not opened! " + leader, STATUS_NOT_OPENED);
  if (b.size() < 1172) return RS_FAIL("File reading failed! " + leader, STATUS_READ_FAILED);
  info->OrbitConfiguration = trimmed(ceosText(b.data() + 820, 16));
  info->OrbitNumber = trimmed(ceosText(b.data() + 1164, 8));
  info->SceneID = trimmed(ceosText(b.data() + 740, 16));
  ORV_REPORT("Orbit configuration read", REPORT_CHECKPOINT);
  return 0;
}

int radarextract::orbit_source(int* source) {
  *source = 0;
  std::string path = OrbitFile;
  if (path.empty()) {
    // The leader's own platform position record serves then.
    ORV_REPORT("No Orbit file is present!", REPORT_ERROR);
    path = LeaderFile;
  }
  std::vector<char> b;
  if (!slurp(path, b)) return RS_FAIL("File not opened! " + path, STATUS_NOT_OPENED);
  if (b.size() >= 19 && std::memcmp(b.data() + 16, "CEO", 3) == 0) {
    const long at = positionRecordOffset(b) + 140;
    if (at + 4 > static_cast<long>(b.size())) return RS_FAIL("File reading failed! " + path, STATUS_READ_FAILED);
    if (ch2int(b.data() + at, 4) < 5) {
      ORV_REPORT("There are less than 3 state vectors in the leader file!", REPORT_ERROR);
      return STATUS_BAD_CONDITION;
    }
    *source = 1;
    return 0;
  }
  const std::string head(b.data(), std::min<std::size_t>(b.size(), 4096));
  if (head.find("GENERATION TIME") != std::string::npos) {
    *source = 2;
    return 0;
  }
  ORV_REPORT("Orbit filename is wrong!", REPORT_ERROR);
  return STATUS_BAD_CONDITION;
}

int radarextract::readSceneDate() {
  std::vector<char> b;
  if (!slurp(LeaderFile, b)) return RS_FAIL("File not opened! " + LeaderFile, STATUS_NOT_OPENED);
  // Scene centre time of the data set summary, "YYYYMMDDhhmmssttt".
  if (b.size() < 788 + 32) return RS_FAIL("File reading failed! " + LeaderFile, STATUS_READ_FAILED);
  const std::string t = ceosText(b.data() + 788, 8);
  int year = 0, month = 0, day = 0;
  if (t.size() != 8 || std::sscanf(t.c_str(), "%4d%2d%2d", &year, &month, &day) != 3 || month < 1 ||
      month > 12 || day < 1 || day > 31)
    return RS_FAIL("Bad scene centre time in the leader file " + LeaderFile, STATUS_BAD_PARAMETER);
  char text[40];
  std::snprintf(text, sizeof text, "%02d-%s-%04d 00:00:00.000000", day, kMonths[month - 1], year);
  sceneMidnight_ = ascii2sec85(text);
  return 0;
}

int radarextract::getTime(double secondsOfDay, double* sec85) const {
  if (sceneMidnight_ < 0.0) return STATUS_BAD_CONDITION;
  *sec85 = sceneMidnight_ + secondsOfDay;
  return 0;
}

int radarextract::leaderVectors(const std::string& leader, double& t0, double& interval, std::vector<double>& pos,
                                std::vector<double>& vel) const {
  std::vector<char> b;
  if (!slurp(leader, b)) return RS_FAIL("File not opened! " + leader, STATUS_NOT_OPENED);
  const long rec = positionRecordOffset(b);
  if (rec + 386 > static_cast<long>(b.size())) return RS_FAIL("File reading failed! " + leader, STATUS_READ_FAILED);
  const int count = ch2int(b.data() + rec + 140, 4);
  const int year = ch2int(b.data() + rec + 144, 4);
  const int month = ch2int(b.data() + rec + 148, 4);
  const int day = ch2int(b.data() + rec + 152, 4);
  double secondsOfDay = 0.0;
  if (count < 1 || month < 1 || month > 12 || day < 1 || day > 31 ||
      !leaderReal(b, rec + 160, 22, secondsOfDay))
    return RS_FAIL("Bad platform position record in the leader file " + leader, STATUS_BAD_PARAMETER);
  if (!leaderReal(b, rec + 182, 22, interval) || !(interval > 0.0)) {
    if (count > 1) return RS_FAIL("Bad state vector interval in the leader file " + leader, STATUS_BAD_PARAMETER);
    interval = 1.0;
  }
  if (rec + 386 + long(count) * kVectorBytes > static_cast<long>(b.size()))
    return RS_FAIL("File reading failed! " + leader, STATUS_READ_FAILED);
  char text[40];
  std::snprintf(text, sizeof text, "%02d-%s-%04d 00:00:00.000000", day, kMonths[month - 1], year);
  t0 = ascii2sec85(text) + secondsOfDay;
  // Archive leaders give the vectors either Earth-fixed or in the true-of-date
  // inertial frame; the latter are turned into the Earth-fixed frame here.
  const bool inertial = ceosText(b.data() + rec + 204, 64).find("INERTIAL") != std::string::npos;
  pos.assign(3 * std::size_t(count), 0.0);
  vel.assign(3 * std::size_t(count), 0.0);
  for (int k = 0; k < count; ++k) {
    const long base = rec + 386 + long(k) * kVectorBytes;
    double p[3], v[3];
    for (int j = 0; j < 3; ++j) {
      if (!leaderReal(b, base + 22 * j, 22, p[j]) || !leaderReal(b, base + 66 + 22 * j, 22, v[j]))
        return RS_FAIL("Bad state vector " + std::to_string(k + 1) + " in the leader file " + leader,
                       STATUS_BAD_PARAMETER);
    }
    // Some products give the velocities in mm/s: no orbit is that fast in m/s.
    if (std::sqrt(v[0] * v[0] + v[1] * v[1] + v[2] * v[2]) > 100000.0)
      for (double& c : v) c /= 1000.0;
    if (inertial) {
      const double g = greenwichAngle(t0 + k * interval), cg = std::cos(g), sg = std::sin(g);
      const double x = cg * p[0] + sg * p[1], y = -sg * p[0] + cg * p[1];
      const double vx = cg * v[0] + sg * v[1] + kEarthRotation * y;
      const double vy = -sg * v[0] + cg * v[1] - kEarthRotation * x;
      p[0] = x;
      p[1] = y;
      v[0] = vx;
      v[1] = vy;
    }
    for (int j = 0; j < 3; ++j) {
      pos[3 * std::size_t(k) + std::size_t(j)] = p[j];
      vel[3 * std::size_t(k) + std::size_t(j)] = v[j];
    }
  }
  return 0;
}

int radarextract::readLeaderVectors(const std::string& leader) {
  CheckedCall cc("radarextract::readLeaderVectors()");
  double t0 = 0.0, interval = 0.0;
  std::vector<double> pos, vel;
  if (int st = leaderVectors(leader, t0, interval, pos, vel); st != 0) return RS_CALLED(st);
  GeneralSAROrbit& orbit = rawData.orbit();
  orbit.SVDestroy();
  orbit.setLambda(kWavelength);
  if (int st = orbit.SVCreate(t0, interval, static_cast<int>(pos.size() / 3)); st != 0) return RS_CALLED(st);
  std::copy(pos.begin(), pos.end(), orbit.pos.begin());
  std::copy(vel.begin(), vel.end(), orbit.vel.begin());
  ORV_REPORT("State Vectors Read", REPORT_CHECKPOINT);
  return 0;
}

int radarextract::writeChirp(const std::vector<float>& replica, int samples) {
  return writeReplicaRaster(OutputChirpFile, reinterpret_cast<const fcomplex*>(replica.data()), samples);
}

int radarextract::openProduct(std::ifstream& in, int& source, int& records, int& recordLength) {
  swstVector.clear();
  sequenceVector.clear();
  missingLines = replicaLines = gainChanges = windowChanges = 0;
  if (int st = readSceneDate(); st != 0) return RS_CALLED(st);
  if (int st = getOrbitConf(LeaderFile, &rawData.dataSetInfo); st != 0) return RS_CALLED(st);
  if (int st = orbit_source(&source); st != 0) return RS_CALLED(st);
  in.open(DataFile, std::ios::binary);
  if (DataFile.empty() || !in) return RS_FAIL("File not opened! " + DataFile, STATUS_NOT_OPENED);
  std::vector<char> descriptor(kDescriptorBytes);
  if (!in.read(descriptor.data(), kDescriptorBytes))
    return RS_FAIL("File reading failed! " + DataFile, STATUS_READ_FAILED);
  records = ch2int(descriptor.data() + 180, 6);
  recordLength = ch2int(descriptor.data() + 186, 6);
  if (records < 1) return RS_FAIL("Bad record count in the descriptor of " + DataFile, STATUS_BAD_PARAMETER);
  if (LinesToSkip < 0 || LinesToExtract < 0 || LinesToSkip >= records)
    return RS_FAIL("Lines to skip " + std::to_string(LinesToSkip) + " and to extract " +
                       std::to_string(LinesToExtract) + " do not fit the " + std::to_string(records) +
                       " lines of " + DataFile,
                   STATUS_BAD_PARAMETER);
  return 0;
}

::DataFile& radarextract::outputRaster(int samples, int lines, int prefix) {
  ::DataFile& out = rawData.dataFile;
  out.filename = OutputRawFile;
  out.NrOfPixelsPerLine = samples;
  out.NrOfLinesPerImage = lines;
  out.RowPrefix = prefix;
  out.CellType = FLOAT_COMPLEX;
  out.HeaderOffset = 0;
  out.ByteOrder = host_byte_order();
  out.buffersize = 0;
  rawData.rasterName = OutputRawFile;
  return out;
}

int radarextract::RADARExtract() {
  CheckedCall cc("radarextract::RADARExtract()");
  std::ifstream in;
  int source = 0, records = 0, recordLength = 0;
  if (int st = openProduct(in, source, records, recordLength); st != 0) return RS_CALLED(st);
  DataSetInfo_Obj& info = rawData.dataSetInfo;
  const int slots = (recordLength - kLineHeadBytes - kAuxBytes) / 2;
  if (slots < 1)
    return RS_FAIL("Bad record length in the signal data file " + DataFile, STATUS_BAD_PARAMETER);
  // Lines filled in for missing ones come on top of the records, so without
  // a count to extract the walk ends with the last record.
  const int lines = LinesToExtract > 0 ? LinesToExtract : INT_MAX;

  std::vector<unsigned char> head(kLineHeadBytes), aux(kAuxBytes), bytes;
  // The first record fixes beam, rates, line length and the reference gain.
  if (!in.read(reinterpret_cast<char*>(head.data()), kLineHeadBytes))
    return RS_FAIL(lineMessage("Main header read failed at line %d", 1) + " of " + DataFile, STATUS_READ_FAILED);
  if (!in.read(reinterpret_cast<char*>(aux.data()), kAuxBytes) || !decodeAux(aux.data()).syncOk)
    return RS_FAIL(lineMessage("Auxiliary header read failed at line %d", 1) + " of " + DataFile +
                       ": no sync marker 352EF853 at the start of the auxiliary head",
                   STATUS_READ_FAILED);
  const AuxHead ref = decodeAux(aux.data());
  const BeamEntry* beam = beamEntry(ref.beamCode);
  if (!beam)
    return RS_FAIL("Beam code " + std::to_string(ref.beamCode) + " outside 1 to 20 in " + DataFile,
                   STATUS_BAD_CONDITION);
  const RateEntry* rate = rateEntry(ref.rateCode);
  const double bandwidth = waveformBandwidth(ref.waveform);
  if (!rate || bandwidth <= 0.0)
    return RS_FAIL("Bad rate code or pulse waveform in the auxiliary head of " + DataFile, STATUS_BAD_PARAMETER);
  const double fs = 1.0 / rate->secondUnit;
  const double pri = (ref.priCode + 2.0) * rate->firstUnit;
  const int samples = std::min(rxSamples(ref.rxCode), slots);
  // A replica line holds the whole replica window; the chirp file keeps the
  // pulse centred in it.
  const int replicaSamples = rate->replicaWindowSamples();
  const int pulseSamples = std::min(replicaPulseSamples(fs), replicaSamples);
  const int pulseOffset = replicaPulseOffset(replicaSamples, pulseSamples);
  in.seekg(kDescriptorBytes);

  ORV_REPORT(std::string(lineMessage("Starting extraction of %d samples per ", samples)) +
                 lineMessage("%d lines", LinesToExtract > 0 ? std::min(LinesToExtract, records - LinesToSkip)
                                                            : records - LinesToSkip),
             REPORT_CHECKPOINT);
  ::DataFile& out = outputRaster(samples, records - LinesToSkip, 4);
  std::vector<float> row, replica;
  try {
    bytes.resize(2 * std::size_t(slots));
    row.assign(1 + 2 * std::size_t(samples), 0.0f);
    swstVector.reserve(std::size_t(records));
    sequenceVector.reserve(std::size_t(records));
  } catch (const std::bad_alloc&) {
    return RS_FAIL("Memory allocation failed for the RADARSAT line buffers", STATUS_NO_MEMORY);
  }
  if (int st = out.open(1); st != 0) return RS_CALLED(st);

  int status = 0, previousNumber = 0, previousGain = ref.gainCode, previousWindow = ref.windowCode;
  float previousSwst = 0.0f;
  double swstMin = 1.0, swstMax = 0.0, firstTime = -1.0, firstSecondsOfDay = -1.0;
  int written = 0;
  auto writeRow = [&](float swst, int number) {
    row[0] = swst;
    if (int st = out.write(row.data(), static_cast<int64_t>(row.size() * sizeof(float))); st != 0)
      return RS_CALLED(st);
    swstVector.push_back(swst);
    sequenceVector.push_back(number);
    ++written;
    ORV_REPORT(lineMessage("Written line %d to file", written), REPORT_CHECKPOINT);
    return 0;
  };
  waitbar_open("Extracting Radarsat RAW Data");
  for (int pos = 0; pos < records && written < lines; ++pos) {
    const int lineNo = pos + 1;
    waitbar_update(0, static_cast<float>(100.0 * pos / records));
    if (!readSignalHead(in, head)) {
      status = RS_FAIL(lineMessage("Main header read failed at line %d", lineNo) + " of " + DataFile,
                       STATUS_READ_FAILED);
      break;
    }
    if (!in.read(reinterpret_cast<char*>(aux.data()), kAuxBytes) || !decodeAux(aux.data()).syncOk) {
      status = RS_FAIL(lineMessage("Auxiliary header read failed at line %d", lineNo) + " of " + DataFile,
                       STATUS_READ_FAILED);
      break;
    }
    if (static_cast<int>(be32(head.data() + 8)) != recordLength)
      ORV_REPORT("Packet length error", REPORT_FILE_IO);
    const AuxHead h = decodeAux(aux.data());
    const int number = static_cast<int>(be32(head.data() + 12));
    // A counter going back, or jumping further than the file has records,
    // is a broken head rather than lost lines.
    if (pos > 0 && (number <= previousNumber || number - previousNumber > records)) {
      status = RS_FAIL(lineMessage("Line index is wrong at line %d, extraction ended", lineNo), STATUS_BAD_CONDITION);
      break;
    }
    if (h.rxCode != ref.rxCode) ORV_REPORT("Rx Duration change", REPORT_FILE_IO);
    // A receiver attenuation change is compensated below, so the scene stays
    // usable: the change is a checkpoint, not the end of the run.
    if (h.gainCode != previousGain) {
      ORV_REPORT("ADC code change", REPORT_CHECKPOINT);
      ++gainChanges;
    }
    previousGain = h.gainCode;
    if (h.windowCode != previousWindow) ++windowChanges;
    previousWindow = h.windowCode;
    const float swst = static_cast<float>(windowStart(h.windowCode, h.priCode, *rate, beam->pulsesInFlight));
    // Lines the recorder lost are filled with zeros at the window of the line before.
    for (int missing = previousNumber + 1; pos > 0 && missing < number; ++missing) {
      ORV_REPORT(lineMessage("Missing line detected at line %d", missing), REPORT_CHECKPOINT);
      ++missingLines;
      if (pos < LinesToSkip || written >= lines) continue;
      std::fill(row.begin() + 1, row.end(), 0.0f);
      if ((status = writeRow(previousSwst, 0)) != 0) break;
    }
    if (status != 0) break;
    previousNumber = number;
    previousSwst = swst;

    int used = 0;
    if (h.replica) {
      ORV_REPORT(lineMessage("Replica samples detected at line %d", lineNo), REPORT_CHECKPOINT);
      ++replicaLines;
      if (replicaSamples > slots ||
          !in.read(reinterpret_cast<char*>(bytes.data()), 2 * std::streamsize(replicaSamples))) {
        status = RS_FAIL(lineMessage("Replica read error at line %d", lineNo), STATUS_READ_FAILED);
        break;
      }
      if (replica.empty()) {
        replica.resize(2 * std::size_t(pulseSamples));
        for (int s = 0; s < 2 * pulseSamples; ++s)
          replica[std::size_t(s)] = sampleValue(bytes[2 * std::size_t(pulseOffset) + std::size_t(s)]);
      }
      used = replicaSamples;
    }
    const int echo = std::min(samples, slots - used);
    if (!in.read(reinterpret_cast<char*>(bytes.data()), 2 * std::streamsize(echo))) {
      status = RS_FAIL(lineMessage("Data read error at line %d", lineNo), STATUS_READ_FAILED);
      break;
    }
    const int fill = slots - used - echo;
    if (fill > 0 &&
        !in.read(reinterpret_cast<char*>(bytes.data()) + 2 * std::size_t(echo), 2 * std::streamsize(fill))) {
      status = RS_FAIL(lineMessage("Zero fill read error at line %d", lineNo), STATUS_READ_FAILED);
      break;
    }
    const double secondsOfDay = auxSecondsOfDay(h);
    if (firstSecondsOfDay < 0.0) firstSecondsOfDay = secondsOfDay;
    if (pos < LinesToSkip) continue;
    if (firstTime < 0.0) {
      double day = secondsOfDay;
      if (day < firstSecondsOfDay - 43200.0) day += 86400.0;  // scene across midnight
      getTime(day, &firstTime);
      ORV_REPORT("First Azimuth time read", REPORT_CHECKPOINT);
    }
    // The receiver setting is an attenuation in dB: a line attenuated d dB
    // more than the first one is raised by 10^(d / 20).
    const float factor = static_cast<float>(std::pow(10.0, (h.gainCode - ref.gainCode) / 20.0));
    for (int s = 0; s < 2 * echo; ++s) row[1 + std::size_t(s)] = sampleValue(bytes[std::size_t(s)]) * factor;
    std::fill(row.begin() + 1 + 2 * echo, row.end(), 0.0f);
    swstMin = std::min(swstMin, static_cast<double>(swst));
    swstMax = std::max(swstMax, static_cast<double>(swst));
    if ((status = writeRow(swst, number)) != 0) break;
  }
  waitbar_close();
  // More lines asked for than the file holds: the scene ends with its last line.
  if (status == 0 && LinesToExtract > 0 && written < lines)
    ORV_REPORT(lineMessage("%d lines extracted: ", written) + DataFile + " ends before " +
                   std::to_string(LinesToExtract) + " lines after the skipped ones",
               REPORT_WARNING);
  out.NrOfLinesPerImage = written;
  const int closed = out.close();
  if (status != 0) return status;
  if (closed != 0) return RS_CALLED(closed);

  // Record of the raster.
  ROI_Obj& roi = rawData.roi;
  SamplingConstants_Obj& smp = rawData.sampling;
  SARPulse_Obj& pulse = rawData.pulse;
  smp.fc_hz = kCarrierHz;
  smp.lambda_m = kWavelength;
  smp.frg_hz = fs;
  smp.Trg_s = 1.0 / fs;
  smp.Brg_hz = bandwidth;
  smp.pri_s = pri;
  smp.prf_hz = 1.0 / pri;
  smp.brf_hz = smp.prf_hz;
  pulse.PulseLength = kPulseLength;
  pulse.Bandwidth = bandwidth;
  pulse.PulseKRate = bandwidth / kPulseLength;
  pulse.PulseSamplingRate = fs;
  roi.SlowStartTime = firstTime;
  roi.SlowTimeDelta = pri;
  roi.SlowTimeLength = (written - 1) * pri;
  roi.Lines = written;
  roi.Samples = samples;
  roi.FastStartTime = swstMin;
  roi.FastTimeDelta = 1.0 / fs;
  roi.FastTimeLength = samples / fs;
  rawData.swath.Acquisition_Start_Time = firstTime;
  info.Swath = beam->name;
  info.SWST_MIN = swstMin;
  info.SWST_MAX = swstMax;
  info.MissingLines = missingLines;
  info.Description = "Radarsat RAW Data";
  info.SetImageType(DataSetInfo_Obj::IT_RAW_DATA);
  info.SetUnitType(DataSetInfo_Obj::UT_VOLT);
  int st = finishRecord(source);
  if (st != 0) return RS_CALLED(st);
  if (!OutputChirpFile.empty()) {
    st = replica.empty() ? pulse.writeChirp(OutputChirpFile) : writeChirp(replica, pulseSamples);
    if (st != 0) return RS_CALLED(st);
    ORV_REPORT("Chirp written to file", REPORT_CHECKPOINT);
  }
  return 0;
}

int radarextract::finishRecord(int source) {
  DataSetInfo_Obj& info = rawData.dataSetInfo;
  const ROI_Obj& roi = rawData.roi;
  info.ProcessingCenter = "ORVANE - Lumbra";
  info.ProcessingSoftware = "Varnelt v1.0";
  info.SetAcqMode(DataSetInfo_Obj::AM_STRIPMAP);
  info.SetSensorType(DataSetInfo_Obj::ST_RADARSAT);
  info.SetProjection(DataSetInfo_Obj::PR_SLANT_RANGE);
  info.StampProcessingDate();
  info.SetSenseDate(roi.SlowStartTime);
  // Orbit: the leader's vectors, or a RADARSAT text orbit around the scene centre.
  const std::string orbitPath = OrbitFile.empty() ? LeaderFile : OrbitFile;
  int st = source == 2 ? rawData.orbit().GetStateVectorsRADAR(orbitPath, roi.SlowStartTime + 0.5 * roi.SlowTimeLength,
                                                              roi.SlowTimeLength)
                       : readLeaderVectors(orbitPath);
  if (st != 0) return RS_CALLED(st);
  if ((st = rawData.writehdr()) != 0) return RS_CALLED(st);
  return 0;
}

// SLC products: the lines of complex 16-bit big-endian samples behind the
// 192-byte head of each record go into a float complex raster without a
// prefix, earliest line first. Products whose leader says the line time
// decreases (ascending passes delivered north up) are turned over here. The
// sampling rate and PRF come from the data set summary, the slant range of
// the first pixel and the line times from the record heads. Pixels are taken
// in increasing range, as the slant-range products are delivered.
int radarextract::extractSLC() {
  CheckedCall cc("radarextract::extractSLC()");
  std::ifstream in;
  int source = 0, records = 0, recordLength = 0;
  if (int st = openProduct(in, source, records, recordLength); st != 0) return RS_CALLED(st);
  DataSetInfo_Obj& info = rawData.dataSetInfo;
  std::vector<char> leader;
  if (!slurp(LeaderFile, leader)) return RS_FAIL("File not opened! " + LeaderFile, STATUS_NOT_OPENED);
  double fsMHz = 0.0, prf = 0.0;
  if (leader.size() < 2262 || !leaderReal(leader, 1430, 16, fsMHz) || !leaderReal(leader, 1654, 16, prf) ||
      !(fsMHz > 0.0) || !(prf > 0.0))
    return RS_FAIL("Bad sampling rate or PRF in the data set summary of " + LeaderFile, STATUS_BAD_PARAMETER);
  const bool decreasing = ceosText(leader.data() + 2254, 8).rfind("DECREASE", 0) == 0;
  const int pixels = (recordLength - kLineHeadBytes) / 4;
  if (pixels < 1) return RS_FAIL("Bad record length in the image file " + DataFile, STATUS_BAD_PARAMETER);
  const int lines = LinesToExtract > 0 ? std::min(LinesToExtract, records - LinesToSkip) : records - LinesToSkip;
  ORV_REPORT(lineMessage("Starting extraction of %d samples per ", pixels) + lineMessage("%d lines", lines),
             REPORT_CHECKPOINT);

  ::DataFile& out = outputRaster(pixels, lines, 0);
  std::vector<unsigned char> head(kLineHeadBytes), bytes;
  std::vector<float> row;
  try {
    bytes.resize(4 * std::size_t(pixels));
    row.resize(2 * std::size_t(pixels));
    sequenceVector.assign(std::size_t(lines), 0);
  } catch (const std::bad_alloc&) {
    return RS_FAIL("Memory allocation failed for the RADARSAT line buffers", STATUS_NO_MEMORY);
  }
  if (int st = out.open(1); st != 0) return RS_CALLED(st);
  int status = 0;
  double firstTime = -1.0, nearRange = 0.0;
  waitbar_open("Extracting Radarsat SLC Data");
  for (int pos = 0; pos < records; ++pos) {
    const int lineNo = pos + 1;
    waitbar_update(0, static_cast<float>(100.0 * pos / records));
    if (!readSignalHead(in, head)) {
      status = RS_FAIL(lineMessage("Main header read failed at line %d", lineNo) + " of " + DataFile,
                       STATUS_READ_FAILED);
      break;
    }
    if (static_cast<int>(be32(head.data() + 12)) != lineNo) {
      status = RS_FAIL(lineMessage("Line index is wrong at line %d, extraction ended", lineNo), STATUS_BAD_CONDITION);
      break;
    }
    if (!in.read(reinterpret_cast<char*>(bytes.data()), 4 * std::streamsize(pixels))) {
      status = RS_FAIL(lineMessage("Data read error at line %d", lineNo) + " of " + DataFile, STATUS_READ_FAILED);
      break;
    }
    const int r = (decreasing ? records - 1 - pos : pos) - LinesToSkip;  // row in time order
    if (r < 0 || r >= lines) continue;
    if (r == 0) {
      const int year = static_cast<int>(be32(head.data() + 36)), day = static_cast<int>(be32(head.data() + 40));
      char text[40];
      std::snprintf(text, sizeof text, "01-JAN-%04d 00:00:00.000000", year);
      firstTime = ascii2sec85(text) + (day - 1) * 86400.0 + be32(head.data() + 44) / 1000.0;
      nearRange = static_cast<std::int32_t>(be32(head.data() + 64));
      ORV_REPORT("First Azimuth time read", REPORT_CHECKPOINT);
    }
    for (std::size_t k = 0; k < row.size(); ++k)
      row[k] = static_cast<std::int16_t>((bytes[2 * k] << 8) | bytes[2 * k + 1]);
    if ((status = out.seek(out.rowstart(r), SEEK_SET)) != 0 ||
        (status = out.write(row.data(), static_cast<int64_t>(row.size() * sizeof(float)))) != 0) {
      status = RS_CALLED(status);
      break;
    }
    sequenceVector[std::size_t(r)] = lineNo;
  }
  waitbar_close();
  const int closed = out.close();
  if (status != 0) return status;
  if (closed != 0) return RS_CALLED(closed);

  ROI_Obj& roi = rawData.roi;
  SamplingConstants_Obj& smp = rawData.sampling;
  smp.fc_hz = kCarrierHz;
  smp.lambda_m = kWavelength;
  smp.frg_hz = fsMHz * 1.0e6;
  smp.Trg_s = 1.0 / smp.frg_hz;
  smp.prf_hz = smp.brf_hz = prf;
  smp.pri_s = 1.0 / prf;
  roi.SlowStartTime = firstTime;
  roi.SlowTimeDelta = 1.0 / prf;
  roi.SlowTimeLength = (lines - 1) / prf;
  roi.Lines = lines;
  roi.Samples = pixels;
  roi.FastStartTime = 2.0 * nearRange / 299792458.0;
  roi.FastTimeDelta = smp.Trg_s;
  roi.FastTimeLength = pixels * smp.Trg_s;
  rawData.swath.Acquisition_Start_Time = firstTime;
  info.SWST_MIN = info.SWST_MAX = roi.FastStartTime;
  info.Description = "Radarsat SLC Data";
  info.SetImageType(DataSetInfo_Obj::IT_AZIMUTH_FOCUSED);
  info.SetUnitType(DataSetInfo_Obj::UT_VOLT);
  if (int st = finishRecord(source); st != 0) return RS_CALLED(st);
  return 0;
}
