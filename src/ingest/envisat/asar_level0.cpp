// ASAR level-0 products: headers, packet heads, timelines and the walk.
#include "ingest/envisat/asar_level0.h"

#include <algorithm>
#include <array>
#include <climits>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <fstream>
#include <memory>
#include <new>

#include "base/status.h"
#include "diag/report.h"
#include "diag/waitbar.h"
#include "ingest/envisat/asar_aux.h"
#include "product/data_set_info.h"

namespace {

int fail(const std::string& message, int status, int line, const char* function) {
  orv_add_report(message, REPORT_ERROR, line, function, __FILE__);
  return status;
}
#define L0_FAIL(message, status) fail((message), (status), __LINE__, __func__)
#define L0_CALLED(status) \
  (orv_add_report("Called function returned ERROR", REPORT_ERROR_CALL_TREE, __LINE__, __func__, __FILE__), (status))
#define L0_WARN(message) orv_add_report((message), REPORT_WARNING, __LINE__, __func__, __FILE__)

std::uint32_t be32(const unsigned char* p) {
  return (std::uint32_t(p[0]) << 24) | (std::uint32_t(p[1]) << 16) | (std::uint32_t(p[2]) << 8) | p[3];
}
int be16(const unsigned char* p) { return (int(p[0]) << 8) | int(p[1]); }

std::string text(const unsigned char* p, int n) { return std::string(reinterpret_cast<const char*>(p), std::size_t(n)); }
std::string trimmed(const std::string& s) {
  const auto a = s.find_first_not_of(" \"");
  if (a == std::string::npos) return {};
  return s.substr(a, s.find_last_not_of(" \"") - a + 1);
}

// IM instrument sequence: 8 noise packets and 97 others before the first
// cycle; a cycle is 1023 echoes and one periodic calibration.
constexpr int kImStartPackets = 105, kImStartNoise = 8, kImCycle = 1024;
// AP start sequence: 16 noise packets, then others up to the first echo.
constexpr int kApStartNoise = 16, kApFirstEcho = 210;
constexpr int kWsFirstEcho = 525;
constexpr int kFirstPassPackets = 1000;
constexpr int kMaxCounterJump = 101;
constexpr long kMaxTimelineRows = 50000000;

// Swath index of an AP echo from bits 6 and 5 of head byte 61.
int apSwathOf(int mode, int bits) {
  switch (mode) {
    case ASAR_APC: return bits == 3 ? 0 : bits == 0 ? 1 : -1;
    case ASAR_APH: return bits == 1 ? 0 : bits == 0 ? 1 : -1;
    case ASAR_APV: return bits == 3 ? 0 : bits == 2 ? 1 : -1;
    default: return -1;
  }
}

// Swath index of a packet by its own head.
int packetSwath(int mode, const PacketHead& h) {
  if (mode == ASAR_IM) return 0;
  if (mode == ASAR_WS || mode == ASAR_GM) return h.swathCode - 15;
  return apSwathOf(mode, h.polarisationBits);
}

// The value seen most often, zeros ignored; a tie goes to the one seen
// first; at most 128 different values are counted.
int mostFrequent(const std::vector<int>& values) {
  std::vector<std::pair<int, int>> counts;
  for (int v : values) {
    if (v == 0) continue;
    auto it = std::find_if(counts.begin(), counts.end(), [v](const auto& c) { return c.first == v; });
    if (it != counts.end()) {
      ++it->second;
    } else if (counts.size() < 128) {
      counts.emplace_back(v, 1);
    }
  }
  int best = 0, bestCount = 0;
  for (const auto& [v, n] : counts)
    if (n > bestCount) best = v, bestCount = n;
  return best;
}

}  // namespace

int Level0File::open(const std::string& path) {
  path_ = path;
  switch (map_.open(path)) {
    case MappedFile::kMapped:
      return 0;
    case MappedFile::kNotOpened:
      return L0_FAIL("File not opened! " + path, STATUS_NOT_OPENED);
    default:
      return L0_FAIL("File reading failed! " + path, STATUS_READ_FAILED);
  }
}

int read_level0_header(const Level0File& file, Level0Header* h) {
  if (!file.has(0, kFirstPacketOffset))
    return L0_FAIL("File reading failed! " + file.path() + ": shorter than its product headers", STATUS_READ_FAILED);
  const unsigned char* mph = file.data();
  const unsigned char* sph = mph + kLevel0MphBytes;
  h->productName = trimmed(text(mph + 9, 62));
  h->orbitNumber = text(mph + 58, 5);
  h->sensingStart = text(mph + 351, 27);
  h->sensingStop = text(mph + 394, 27);
  h->modeName = trimmed(text(sph + 20, 3));
  h->startLat = std::atof(text(sph + 56, 11).c_str());
  h->stopLat = std::atof(text(sph + 120, 11).c_str());
  // The SAT_TRACK value begins behind its '=' at 183.
  h->track = text(sph + 184, 15);
  h->polarisation = text(sph + 775, 5);
  h->swathName = text(sph + 789, 3);
  h->records = std::atol(text(sph + 1044, 10).c_str());
  h->mode = -1;
  const std::string three = text(sph + 20, 3), two = three.substr(0, 2);
  for (int m = 0; m < 6; ++m) {
    const std::string name = asarModeInfo(m).sphName;
    if ((name.size() == 3 && three == name) || (name.size() == 2 && two == name && three != "APC"))
      h->mode = m;
  }
  if (h->mode < 0) {
    ORV_REPORT("UNRECOGNIZED type! " + file.path(), REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  return 0;
}

PacketHead parse_packet_head(const unsigned char* p) {
  PacketHead h;
  // The acquisition time is big-endian, as every number of the ENVISAT
  // formats: the genuine products give their sensing start this way (for
  // example day 4471, 25894 s, 432858 us), while the three words taken in
  // the machine order of an x86 host give a day of 1997602816.
  h.time.days = static_cast<std::int32_t>(be32(p));
  h.time.seconds = static_cast<std::int32_t>(be32(p + 4));
  h.time.microseconds = static_cast<std::int32_t>(be32(p + 8));
  h.applicationId = be16(p + 32) & 0x7FF;
  h.sequenceCount = be16(p + 34) & 0x3FFF;
  h.packetLength = be16(p + 36);
  h.dataHeaderLength = be16(p + 38);
  h.modeId = p[41];
  h.modeCounter = (int(p[48]) << 16) | (int(p[49]) << 8) | int(p[50]);
  h.swathCode = p[51] >> 2;
  h.typeFlags = p[52];
  h.cyclePacket = ((p[52] & 15) << 8) | p[53];
  h.priCode = be16(p + 54);
  h.swstCode = be16(p + 56);
  h.swlCode = be16(p + 58);
  h.polarisationBits = (p[61] >> 5) & 3;
  h.calibrationRow = p[61] & 31;
  h.pulseLengthCode = (int(p[62]) << 2) | (p[63] >> 6);
  h.chirpBandCode = p[64];
  return h;
}

int checkheader(const PacketHead& h, int mode) {
  const AsarModeInfo& info = asarModeInfo(mode);
  char message[160] = {};
  int score = 0;
  if ((h.modeCounter & 0x3FFF) != h.sequenceCount) {
    score += 12;
    std::snprintf(message, sizeof message, "Counter ERROR: MODE COUNTER=%d, SEQ_COUNT=%d.\n", h.modeCounter,
                  h.sequenceCount);
  }
  if (h.applicationId != info.applicationId) {
    score += 4;
    std::snprintf(message, sizeof message, "ApplicationID ERROR: read=%d, expected=%d\n", h.applicationId,
                  info.applicationId);
  }
  if (h.modeId != info.modeId) {
    score += 4;
    std::snprintf(message, sizeof message, "ModeID ERROR: read=%d, expected=%d\n", h.modeId, info.modeId);
  }
  if (h.dataHeaderLength != kDataFieldHeaderBytes) {
    score += 4;
    std::snprintf(message, sizeof message, "Header length ERROR: read=%d, expected=%d\n", h.dataHeaderLength,
                  kDataFieldHeaderBytes);
  }
  const int s = h.swathCode - info.firstSwathCode;
  if (s < 0 || s >= info.swathCount) {
    score += 12;
    std::snprintf(message, sizeof message, "Swath %d out of range.\n", h.swathCode);
  }
  if (score > 0 && asar_reports_on()) ORV_REPORT(message, REPORT_WARNING);
  // A packet shorter than its data field header would never move the walk
  // on: such a head is never trusted.
  if (h.packetLength < kDataFieldHeaderBytes) score += 12;
  return score;
}

long synchromdsr(const Level0File& file, long from, int mode) {
  const bool was = asar_reports_on();
  set_asar_reports(false);
  long found = from + kSyncWindow;
  const long last = std::min(from + kSyncWindow - kPacketHeadBytes, file.size() - kPacketHeadBytes);
  for (long off = std::max(from, 0L); off < last; ++off) {
    if (checkheader(parse_packet_head(file.data() + off), mode) == 0) {
      found = off;
      break;
    }
  }
  set_asar_reports(was);
  return found;
}

namespace {

// Reads heads from pos on, re-synchronising on heads that cannot be
// trusted; false at the end of the file.
bool nextTrustedHead(const Level0File& file, int mode, long& pos, PacketHead& head, int threshold) {
  while (file.has(pos, kPacketHeadBytes)) {
    head = parse_packet_head(file.data() + pos);
    if (checkheader(head, mode) < threshold) return true;
    pos = synchromdsr(file, pos + 2, mode);
  }
  return false;
}

}  // namespace

int loadparam(const Level0File& file, const char* ins, int mode, sarpar* par, int* swaths) {
  const int n = asarModeInfo(mode).files;
  *swaths = n;
  for (int s = 0; s < n; ++s) par[s] = sarpar{};
  if (isApMode(mode)) {
    static constexpr int kPolarisations[3][2] = {{1, 0}, {2, 0}, {1, 3}};  // APC, APH, APV
    for (int s = 0; s < 2; ++s) par[s].polarization_type = kPolarisations[mode - ASAR_APC][s];
  }
  Level0Header header;
  if (int st = read_level0_header(file, &header); st != 0) return L0_CALLED(st);
  if (header.mode != mode)
    return L0_FAIL("The product " + file.path() + " is not of the mode asked for", STATUS_BAD_CONDITION);
  if (mode == ASAR_IM) {
    const std::string p = trimmed(header.polarisation);
    par[0].polarization_type = p == "V/V" ? 1 : p == "H/V" ? 2 : p == "V/H" ? 3 : 0;
  }

  enum { kSwl, kPulse, kChirp, kPri, kCode, kSwst, kSeries };
  std::vector<std::array<std::vector<int>, kSeries>> series(static_cast<std::size_t>(n));
  std::vector<int> firstPacket(std::size_t(n), -1), noiseCodes;
  long pos = kFirstPacketOffset;
  PacketHead h;
  for (int k = 0; k < kFirstPassPackets; ++k) {
    if (!nextTrustedHead(file, mode, pos, h, 1)) break;
    if (!h.isEcho()) {
      if ((mode == ASAR_WS || mode == ASAR_GM) && (h.typeFlags & 0x40)) noiseCodes.push_back(h.swlCode);
    } else if (const int s = packetSwath(mode, h); s >= 0 && s < n) {
      auto& v = series[std::size_t(s)];
      v[kSwl].push_back(h.swlCode);
      v[kPulse].push_back(h.pulseLengthCode);
      v[kChirp].push_back(h.chirpBandCode);
      v[kPri].push_back(h.priCode);
      v[kCode].push_back(h.swathCode);
      v[kSwst].push_back(h.swstCode);
      if (firstPacket[std::size_t(s)] < 0) firstPacket[std::size_t(s)] = k;
    }
    pos += h.packetBytes();
  }
  std::vector<int> codes(static_cast<std::size_t>(n));
  for (int s = 0; s < n; ++s) {
    const auto& v = series[std::size_t(s)];
    if (v[kSwl].empty())
      return L0_FAIL("No echo of swath " + std::to_string(s) + " among the first packets of " + file.path(),
                     STATUS_BAD_CONDITION);
    sarpar& p = par[s];
    p.SWL_code = p.samples = mostFrequent(v[kSwl]);
    p.pulseLengthCode = mostFrequent(v[kPulse]);
    p.chirpBandCode = mostFrequent(v[kChirp]);
    p.PRI_code = mostFrequent(v[kPri]);
    p.swathCode = mostFrequent(v[kCode]);
    p.SWST_code = p.SWST_max_code = mostFrequent(v[kSwst]);
    p.SWL_noise_code = mostFrequent(noiseCodes);
    p.firstPacket = firstPacket[std::size_t(s)];
    codes[std::size_t(s)] = p.swathCode;
    if (p.SWL_code < 1 || p.PRI_code < 1 || p.pulseLengthCode < 1)
      return L0_FAIL("No window length, PRI or pulse length code in the echoes of " + file.path(),
                     STATUS_BAD_CONDITION);
  }
  // WS and GM: the bursts follow one another in the order of their first
  // packets, counted from swath 0.
  std::vector<int> byFirst(static_cast<std::size_t>(n));
  for (int s = 0; s < n; ++s) byFirst[std::size_t(s)] = s;
  if (mode == ASAR_WS || mode == ASAR_GM) {
    std::stable_sort(byFirst.begin(), byFirst.end(),
                     [&](int a, int b) { return firstPacket[std::size_t(a)] < firstPacket[std::size_t(b)]; });
    std::rotate(byFirst.begin(), std::find(byFirst.begin(), byFirst.end(), 0), byFirst.end());
  }
  for (int k = 0; k < n; ++k) par[byFirst[std::size_t(k)]].order = k;

  if (int st = asainspar(ins, par, mode, codes.data(), n); st != 0) return L0_CALLED(st);
  for (int s = 0; s < n; ++s) {
    sarpar& p = par[s];
    p.prf = p.Sampling_frequency / p.PRI_code;
    p.pulseLength = p.pulseLengthCode / p.Sampling_frequency;
    p.chirpBandwidth = p.chirpBandCode * kChirpBandStep;
    p.Resampl_fact = 1;
    // IM names its swath in the SPH; both polarisations of AP share the beam
    // of their packets' swath code; WS and GM count their sub-swaths.
    if (mode == ASAR_IM)
      p.swathNumber = header.swathName.size() == 3 ? header.swathName[2] - '0' : p.swathCode;
    else if (isApMode(mode))
      p.swathNumber = p.swathCode;
    else
      p.swathNumber = s + 1;
    p.meanLatitude = (header.startLat + header.stopLat) * 5e-07;
  }
  return 0;
}

namespace {

int firstAndLastHeads(const Level0File& file, int mode, PacketHead* first, PacketHead* last) {
  long pos = kFirstPacketOffset;
  if (!nextTrustedHead(file, mode, pos, *first, 1))
    return L0_FAIL("File reading failed! " + file.path() + ": no valid packet", STATUS_READ_FAILED);
  // Backwards from the end for the last complete echo.
  const bool was = asar_reports_on();
  set_asar_reports(false);
  bool found = false;
  const long stop = std::max(kFirstPacketOffset, file.size() - kSyncWindow);
  for (long off = file.size() - kPacketHeadBytes; off >= stop && !found; --off) {
    const PacketHead h = parse_packet_head(file.data() + off);
    if (h.isEcho() && checkheader(h, mode) == 0 && file.has(off, h.packetBytes())) {
      *last = h;
      found = true;
    }
  }
  set_asar_reports(was);
  if (!found || last->modeCounter < first->modeCounter)
    return L0_FAIL("File reading failed! " + file.path() + ": no complete echo packet (truncated product?)",
                   STATUS_READ_FAILED);
  if (long(last->modeCounter) - first->modeCounter + 1 > kMaxTimelineRows)
    return L0_FAIL("File reading failed! " + file.path() + ": packet counters out of range", STATUS_READ_FAILED);
  return 0;
}

void finishTable(Timeline* t, const PacketHead& first, const PacketHead& last) {
  t->firstCounter = first.modeCounter;
  t->lastCounter = last.modeCounter;
  t->startTime = first.seconds85();
  t->stopTime = last.seconds85();
  t->firstEchoCounter = t->lastCounter + 1;
  for (std::size_t r = 0; r < t->rows.size(); ++r)
    if ((t->rows[r].kind & 3) == 0) {
      t->firstEchoCounter = t->firstCounter + int(r);
      break;
    }
  t->lines = (t->lastCounter - t->firstEchoCounter + 1) / t->rowsPerLine;
}

}  // namespace

int init_IM_table(const Level0File& file, int mode, const sarpar* par, Timeline* t) {
  PacketHead first, last;
  if (int st = firstAndLastHeads(file, mode, &first, &last); st != 0) return st;
  *t = Timeline{};
  t->step = 1.0 / par[0].prf;
  t->rowsPerLine = 1;
  t->firstCyclePosition = first.cyclePacket;
  t->firstCycle = first.modeCounter >= kImStartPackets ? (first.modeCounter - kImStartPackets) / kImCycle : 0;
  t->rows.assign(std::size_t(last.modeCounter - first.modeCounter + 1), TimelineRow{});
  for (std::size_t r = 0; r < t->rows.size(); ++r) {
    const int c = first.modeCounter + int(r);
    TimelineRow& row = t->rows[r];
    if (c < kImStartPackets) {
      row.kind = c < kImStartNoise ? 2 : 3;
      continue;
    }
    // The cycle position of the first head carries the rows that follow it.
    const int p = first.modeCounter >= kImStartPackets ? (first.cyclePacket + int(r)) % kImCycle
                                                       : (c - kImStartPackets) % kImCycle;
    row.kind = p == kImCycle - 1 ? 1 : p == 0 ? kRowCycleStart : 0;
  }
  finishTable(t, first, last);
  return 0;
}

int init_AP_table(const Level0File& file, int mode, const sarpar* par, Timeline* t) {
  PacketHead first, last;
  if (int st = firstAndLastHeads(file, mode, &first, &last); st != 0) return st;
  *t = Timeline{};
  t->step = 1.0 / par[0].prf;
  t->rowsPerLine = 1;
  t->firstCyclePosition = first.cyclePacket;
  // The polarisation changes from burst to burst; the burst length is read
  // from the first polarisation changes of the echoes.
  int change1 = -1, change2 = -1, previous = -1;
  long pos = kFirstPacketOffset;
  PacketHead h;
  for (int k = 0; k < 4 * kFirstPassPackets && change2 < 0; ++k) {
    if (!nextTrustedHead(file, mode, pos, h, 1)) break;
    if (h.isEcho()) {
      const int s = apSwathOf(mode, h.polarisationBits);
      if (previous >= 0 && s != previous) (change1 < 0 ? change1 : change2) = h.modeCounter;
      if (s >= 0) previous = s;
      if (change1 == h.modeCounter) t->firstPolarisation = s;
    }
    pos += h.packetBytes();
  }
  t->burstLength = change2 > change1 && change1 >= 0 ? change2 - change1 : 1;
  const int anchor = change1 >= 0 ? change1 : first.modeCounter;
  if (change1 < 0) t->firstPolarisation = std::max(0, apSwathOf(mode, first.polarisationBits));
  t->rows.assign(std::size_t(last.modeCounter - first.modeCounter + 1), TimelineRow{});
  for (std::size_t r = 0; r < t->rows.size(); ++r) {
    const int c = first.modeCounter + int(r);
    TimelineRow& row = t->rows[r];
    if (c < kApFirstEcho) {
      row.kind = c < kApStartNoise ? 2 : 3;
      row.swath = static_cast<std::uint16_t>(c / 8);
      continue;
    }
    const long rel = long(c) - anchor;
    const long burst = rel >= 0 ? rel / t->burstLength : -((-rel + t->burstLength - 1) / t->burstLength);
    const long inBurst = rel - burst * t->burstLength;
    row.swath = static_cast<std::uint16_t>((burst & 1) == 0 ? t->firstPolarisation : 1 - t->firstPolarisation);
    row.kind = static_cast<std::uint16_t>(inBurst == t->burstLength - 1 ? kRowBurstEnd : 0);
    if (inBurst == 0) row.kind |= kRowCycleStart;
  }
  finishTable(t, first, last);
  return 0;
}

// WS and GM lie outside stripmap focusing: their tables give every packet
// after the start sequence as an echo of the swath its burst order names.
int init_WS_table(const Level0File& file, int mode, const sarpar* par, int swaths, Timeline* t) {
  PacketHead first, last;
  if (int st = firstAndLastHeads(file, mode, &first, &last); st != 0) return st;
  *t = Timeline{};
  t->rowsPerLine = 1;
  for (int s = 0; s < swaths; ++s) t->step += (par[s].Swath_rank + par[s].secondRank) / par[s].prf;
  t->rows.assign(std::size_t(last.modeCounter - first.modeCounter + 1), TimelineRow{});
  for (std::size_t r = 0; r < t->rows.size(); ++r)
    t->rows[r].kind = first.modeCounter + int(r) < kWsFirstEcho ? 3 : 0;
  finishTable(t, first, last);
  return 0;
}

int init_GM_table(const Level0File& file, int mode, const sarpar* par, int swaths, Timeline* t) {
  return init_WS_table(file, mode, par, swaths, t);
}

namespace {

// One pass over the timeline, writing one raster for each swath.
class Walk {
 public:
  Walk(const Level0File& file, sarpar* par, int swaths, extconf* conf)
      : file_(file), par_(par), swaths_(swaths), conf_(conf), mode_(conf->mode) {}

  int run(const ExtractionFiles& files, Timeline& table);

 private:
  struct Swath {
    std::ofstream out;
    std::vector<char> outBuffer;
    std::vector<float> line, zero;
    bool haveCode = false;
    int code = 0, minCode = INT_MAX, maxCode = INT_MIN, changes = 0;
    int lines = 0;
  };
  float prefix(int s, int code) const {
    const sarpar& p = par_[s];
    return static_cast<float>(code / p.Sampling_frequency + p.Swath_rank / p.prf - p.Range_gate_bias);
  }
  int writeLine(int s, int code, const float* samples, int missing, int sequence);
  // Window code of a swath: the one in use, or before its first echo the
  // most frequent code of the first pass.
  int codeOf(int s) const {
    const Swath& w = sw_[std::size_t(s)];
    return w.haveCode ? w.code : par_[s].SWST_code;
  }
  void note(int s, int code) {
    sw_[std::size_t(s)].minCode = std::min(sw_[std::size_t(s)].minCode, code);
    sw_[std::size_t(s)].maxCode = std::max(sw_[std::size_t(s)].maxCode, code);
  }
  bool readHead();
  int decodeEcho(int s);
  void fillBuffers();
  int checkmissing();
  int calibrationLines(int s, double time, const std::string& folder);

  const Level0File& file_;
  sarpar* par_;
  int swaths_;
  extconf* conf_;
  int mode_;
  std::vector<Swath> sw_;
  std::vector<float> droop_, scratch_;
  long pos_ = kFirstPacketOffset;
  PacketHead head_;
  bool end_ = false;
  double firstTime_ = 0.0;
  bool timeSet_ = false;
};

bool Walk::readHead() {
  end_ = !nextTrustedHead(file_, mode_, pos_, head_, kUntrustedScore);
  return !end_;
}

int Walk::writeLine(int s, int code, const float* samples, int missing, int sequence) {
  Swath& w = sw_[std::size_t(s)];
  const float t = prefix(s, code);
  w.out.write(reinterpret_cast<const char*>(&t), sizeof t);
  w.out.write(reinterpret_cast<const char*>(samples), std::streamsize(sizeof(float) * w.line.size()));
  if (!w.out) return L0_FAIL("File writing failed! line " + std::to_string(w.lines + 1), STATUS_WRITE_FAILED);
  ++w.lines;
  if (s < 2) {
    conf_->swst[s].push_back(code);
    conf_->missing[s].push_back(missing);
    conf_->sequence[s].push_back(sequence);
  }
  return 0;
}

// Decodes the current packet's echo into the line buffer of swath s, divided
// by the droop gain of each sample; 1 (buffer kept) when the window does not
// fit the packet.
int Walk::decodeEcho(int s) {
  Swath& w = sw_[std::size_t(s)];
  const int samples = par_[s].samples;
  const long bytes = head_.dataBytes();
  const int lineBytes = fbaq_line_bytes(samples);
  if (bytes <= 0 || bytes % lineBytes != 0 || !file_.has(pos_, head_.packetBytes()))
    return STATUS_BAD_CONDITION;
  scratch_.resize(std::size_t(bytes / lineBytes) * 2 * std::size_t(samples));
  int floats = 0, lines = 0;
  if (fbaq_decode84_f(file_.data() + pos_ + kPacketHeadBytes, scratch_.data(), int(bytes), samples, 1, &floats,
                      &lines) != 0)
    return STATUS_BAD_CONDITION;
  const float* g = droop_.data();
  for (int k = 0; k < samples; ++k) {
    const float inv = 1.0f / g[std::min(k, kDroopSamples - 1)];
    w.line[2 * std::size_t(k)] = scratch_[2 * std::size_t(k)] * inv;
    w.line[2 * std::size_t(k) + 1] = scratch_[2 * std::size_t(k) + 1] * inv;
  }
  return 0;
}

// Reads ahead, without losing the position, until every swath has an echo
// in its line buffer, so that a missing first line has a line to repeat.
void Walk::fillBuffers() {
  const long keepPos = pos_;
  const PacketHead keepHead = head_;
  std::vector<bool> filled(std::size_t(swaths_), false);
  int left = swaths_;
  for (int k = 0; k < 4 * kFirstPassPackets && left > 0 && !end_; ++k) {
    if (head_.isEcho()) {
      const int s = packetSwath(mode_, head_);
      if (s >= 0 && s < swaths_ && !filled[std::size_t(s)] && decodeEcho(s) == 0) {
        filled[std::size_t(s)] = true;
        --left;
        if (!timeSet_) firstTime_ = head_.seconds85(), timeSet_ = true;
      }
    }
    pos_ += head_.packetBytes();
    readHead();
  }
  pos_ = keepPos;
  head_ = keepHead;
  end_ = false;
}

// Looks 10 packets ahead and comes back; the walk does not use the result.
int Walk::checkmissing() {
  const long keepPos = pos_;
  const PacketHead keepHead = head_;
  int valid = 0;
  for (int k = 0; k < 10 && readHead(); ++k, ++valid) pos_ += head_.packetBytes();
  pos_ = keepPos;
  head_ = keepHead;
  end_ = false;
  return valid;
}

int Walk::calibrationLines(int s, double time, const std::string& folder) {
  static const char* kNames[4] = {"CAL3SS%d", "CAL2SS%d", "CAL1ASS%d", "CAL1SS%d"};
  const long bytes = head_.dataBytes();
  const long perPulse = bytes / 4 / 2;
  if (perPulse < 1 || !file_.has(pos_, head_.packetBytes())) return 0;
  const unsigned char* d = file_.data() + pos_ + kPacketHeadBytes;
  std::vector<float> v(std::size_t(2 * perPulse));
  for (int j = 0; j < 4; ++j) {
    char name[64];
    std::snprintf(name, sizeof name, kNames[j], par_[s].swathNumber);
    std::ofstream out(folder + name, std::ios::binary | std::ios::app);
    for (long k = 0; k < 2 * perPulse; ++k) v[std::size_t(k)] = float(d[2 * perPulse * j + k]) - 127.5f;
    const std::int32_t row = head_.calibrationRow;
    out.write(reinterpret_cast<const char*>(&time), sizeof time);
    out.write(reinterpret_cast<const char*>(&row), sizeof row);
    out.write(reinterpret_cast<const char*>(v.data()), std::streamsize(v.size() * sizeof(float)));
    if (!out) return L0_FAIL(std::string("File writing failed! ") + folder + name, STATUS_WRITE_FAILED);
  }
  return 0;
}

int Walk::run(const ExtractionFiles& files, Timeline& table) {
  const bool ap = isApMode(mode_);
  const int type = conf_->packetType;
  if (int st = LUTfbaq_f(files.ins.c_str(), nullptr, nullptr); st != 0) return L0_CALLED(st);
  droop_.resize(kDroopSamples);
  if (int st = getDROOPgain(files.ins.c_str(), droop_.data(), kDroopSamples); st != 0) return L0_CALLED(st);
  if (int(files.outputs.size()) < swaths_)
    return L0_FAIL("An output raster is needed for each of the " + std::to_string(swaths_) + " swaths",
                   STATUS_BAD_PARAMETER);

  // Part of the scene to extract.
  double skip = std::max(0.0, conf_->skip);
  if (skip > 100.0) return L0_FAIL("Wrong SkipLines parameter!", STATUS_BAD_CONDITION);
  double extract = conf_->extract;
  if (extract <= 0.0 || skip + extract > 100.0) extract = 100.0 - skip;
  const long skipLines = std::lround(skip * table.lines / 100.0);
  const long keep = std::lround(extract * table.lines / 100.0);
  const long firstRow = table.rowsPerLine * skipLines - table.firstCounter + table.firstEchoCounter;
  const long endRow = std::min<long>(firstRow + table.rowsPerLine * keep, long(table.rows.size()));
  for (long r = std::max(0L, firstRow); r < endRow; ++r)
    if ((table.rows[std::size_t(r)].kind & 3) == type) table.rows[std::size_t(r)].kind |= kRowRequested;

  sw_.resize(std::size_t(swaths_));
  for (int s = 0; s < swaths_; ++s) {
    Swath& w = sw_[std::size_t(s)];
    w.line.assign(2 * std::size_t(par_[s].samples), 0.0f);
    w.zero.assign(w.line.size(), 0.0f);
    if (type == 2) {
      w.out.open(files.outputs[std::size_t(s)], std::ios::binary | std::ios::trunc);
    } else {
      w.outBuffer.resize(33554432);
      w.out.rdbuf()->pubsetbuf(w.outBuffer.data(), std::streamsize(w.outBuffer.size()));
      w.out.open(files.outputs[std::size_t(s)], std::ios::binary | std::ios::trunc);
    }
    if (!w.out) return L0_FAIL("File not opened! " + files.outputs[std::size_t(s)], STATUS_NOT_OPENED);
  }
  for (int s = 0; s < 2; ++s) conf_->swst[s].clear(), conf_->missing[s].clear(), conf_->sequence[s].clear();
  const std::string folder = [&] {
    const auto slash = files.outputs[0].find_last_of('/');
    return slash == std::string::npos ? std::string() : files.outputs[0].substr(0, slash + 1);
  }();

  // To the first packet of the range, quietly.
  readHead();
  while (!end_ && head_.modeCounter < table.firstCounter + firstRow) {
    pos_ += head_.packetBytes();
    readHead();
  }

  double noiseSum = 0.0;
  int noiseLines = 0;
  int status = 0, lastPercent = -1;
  waitbar_open("EXTRACTING LEVEL 0");
  for (long r = std::max(0L, firstRow); r < endRow && status == 0; ++r) {
    const int percent = int(100.0 * double(r - firstRow) / double(std::max(1L, endRow - firstRow)));
    if (percent != lastPercent) waitbar_update(0, float(percent)), lastPercent = percent;
    TimelineRow& row = table.rows[std::size_t(r)];
    const int expected = table.firstCounter + int(r);
    if (row.swath > 665) {
      row.swath = static_cast<std::uint16_t>(row.swath - 666);
      for (int s = 0; s < 2 && status == 0; ++s)
        status = writeLine(s, codeOf(s), sw_[std::size_t(s)].zero.data(), 1, 0);
    }
    while (!end_ && (head_.modeCounter < expected || head_.modeCounter >= expected + kMaxCounterJump)) {
      if (!conf_->corrupted) {
        ORV_REPORT("Data is corrupted", REPORT_WARNING);
        conf_->corrupted = true;
      }
      pos_ += head_.packetBytes();
      readHead();
    }
    if (r == firstRow) fillBuffers();
    const int rowSwath = ap ? row.swath : 0;
    if (end_ || head_.modeCounter > expected) {
      checkmissing();
      if (row.kind & kRowRequested) {
        const int s = rowSwath;
        Swath& w = sw_[std::size_t(s)];
        if (!w.haveCode) w.code = par_[s].SWST_code;
        note(s, w.code);
        if (type == 0) {
          status = writeLine(s, w.code, w.line.data(), 1, 0);
          if (ap && status == 0) status = writeLine(1 - s, codeOf(1 - s), sw_[std::size_t(1 - s)].zero.data(), 1, 0);
          ++conf_->missingLines;
        }
      }
      row.kind |= kRowMissing;
      continue;
    }
    // The packet of this row.
    const int kind = row.kind & 3;
    const int own = packetSwath(mode_, head_);
    const int s = ap ? rowSwath : (mode_ == ASAR_IM ? 0 : std::clamp(own, 0, swaths_ - 1));
    if (kind == 0) {
      if (head_.typeFlags < 128) ORV_REPORT("Type flag is incorrect! Expected Echo!", REPORT_WARNING);
      decodeEcho(s);
      if (own != s) {
        char m[120];
        std::snprintf(m, sizeof m, "Mdsr swath is not equal to packet swath. Mdsr is %d - Table is %d", own, s);
        ORV_REPORT(m, REPORT_WARNING);
      }
      Swath& w = sw_[std::size_t(s)];
      const int code = head_.swstCode;
      if (!w.haveCode) {
        w.code = code;
        w.haveCode = true;
      } else if (code != w.code) {
        ++w.changes;
        if (std::abs(code - w.code) > 100) {
          char m[120];
          std::snprintf(m, sizeof m, "WST out of range! - Swath SS%d - %d samples leap. ", par_[s].swathNumber,
                        code - w.code);
          ORV_REPORT(m, REPORT_WARNING);
          ++conf_->windowJumps;
        } else {
          w.code = code;
        }
      }
      note(s, w.code);
      if (!timeSet_) firstTime_ = head_.seconds85(), timeSet_ = true;
      if (type == 0) {
        status = writeLine(s, w.code, w.line.data(), 0, expected);
        if (ap && status == 0) {
          Swath& o = sw_[std::size_t(1 - s)];
          status = writeLine(1 - s, codeOf(1 - s), o.zero.data(), 0, expected);
        }
      }
    } else if (kind == 2 && (mode_ == ASAR_WS || mode_ == ASAR_GM)) {
      if (!(head_.typeFlags & 0x40)) ORV_REPORT("Type flag is incorrect! Expected Noise!", REPORT_WARNING);
      const int samples = head_.swlCode;
      const long bytes = head_.dataBytes();
      const int lineBytes = (samples + 1) / 2 * 2;
      if (samples > 0 && bytes % lineBytes == 0 && file_.has(pos_, head_.packetBytes())) {
        scratch_.resize(std::size_t(bytes / lineBytes) * 2 * std::size_t(samples));
        int floats = 0, lines = 0;
        fbaq_decode84fe(file_.data() + pos_ + kPacketHeadBytes, scratch_.data(), int(bytes), samples, 1, &floats,
                        &lines);
        double power = 0.0;
        for (int k = 0; k < samples; ++k)
          power += double(scratch_[2 * std::size_t(k)]) * scratch_[2 * std::size_t(k)] +
                   double(scratch_[2 * std::size_t(k) + 1]) * scratch_[2 * std::size_t(k) + 1];
        noiseSum += power / samples;
        ++noiseLines;
        ++par_[s].Noise_packets;
        if (type == 2) {
          Swath& w = sw_[std::size_t(s)];
          const float t = prefix(s, head_.swstCode);
          w.out.write(reinterpret_cast<const char*>(&t), sizeof t);
          w.out.write(reinterpret_cast<const char*>(scratch_.data()), std::streamsize(sizeof(float) * 2 * samples));
          if (!w.out) status = L0_FAIL("File writing failed!", STATUS_WRITE_FAILED);
          ++w.lines;
        }
      }
    } else if (kind == 1) {
      if ((head_.typeFlags & 0x30) != 0x30)
        ORV_REPORT("Type flag is incorrect! Expected Periodic calibration!", REPORT_WARNING);
      if (mode_ != ASAR_IM && !ap && own != s) {
        char m[120];
        std::snprintf(m, sizeof m, "Mdsr swath is not equal to packet swath. Mdsr is SS%d - Table is SS%d\n", own, s);
        ORV_REPORT(m, REPORT_WARNING);
      }
      if (type != 1 && (mode_ == ASAR_IM || ap)) {
        Swath& w = sw_[std::size_t(s)];
        if (!w.haveCode) w.code = par_[s].SWST_code;
        status = writeLine(s, w.code, w.line.data(), 1, 0);
        if (ap && status == 0) status = writeLine(1 - s, codeOf(1 - s), sw_[std::size_t(1 - s)].zero.data(), 1, 0);
      } else if (type == 1) {
        status = calibrationLines(s, head_.seconds85(), folder);
      }
    }
    if (r + 1 < endRow && !end_) {
      pos_ += head_.packetBytes();
      readHead();
    }
  }
  waitbar_close();
  for (auto& w : sw_) {
    w.out.close();
    if (status == 0 && w.out.fail()) status = L0_FAIL("File writing failed!", STATUS_WRITE_FAILED);
  }
  if (status != 0) return status;

  int lo = INT_MAX, hi = INT_MIN;
  for (int s = 0; s < swaths_; ++s) lo = std::min(lo, sw_[std::size_t(s)].minCode), hi = std::max(hi, sw_[std::size_t(s)].maxCode);
  for (int s = 0; s < swaths_; ++s) {
    sarpar& p = par_[s];
    Swath& w = sw_[std::size_t(s)];
    if (!ap) lo = w.minCode, hi = w.maxCode;
    if (lo == INT_MAX) lo = hi = p.SWST_code;
    p.SWST_code = lo;
    p.SWST_max_code = hi;
    p.Azimuth_time_reference = firstTime_;
    const double shift = p.Swath_rank / p.prf - p.Range_gate_bias;
    p.nearRangeTime = lo / p.Sampling_frequency + shift;
    p.farRangeTime = hi / p.Sampling_frequency + shift;
    p.lines = w.lines;
    if (ap) p.echoesPerBurst = table.burstLength;
    if (noiseLines > 0) p.noisePower = noiseSum / noiseLines;
  }
  ORV_REPORT("Extraction Ended", REPORT_CHECKPOINT);
  return 0;
}

}  // namespace

int envi_extract(const ExtractionFiles& files, sarpar* par, extconf* conf, int* swaths) {
  conf->done = false;
  conf->missingLines = conf->windowJumps = 0;
  conf->corrupted = false;
  set_asar_reports(true);
  Level0File file;
  if (int st = file.open(files.level0); st != 0) return L0_CALLED(st);
  Level0Header header;
  if (int st = read_level0_header(file, &header); st != 0) return L0_CALLED(st);
  conf->mode = header.mode;
  if (int st = loadparam(file, files.ins.c_str(), header.mode, par, swaths); st != 0) return L0_CALLED(st);
  Timeline table;
  int st = 0;
  if (header.mode == ASAR_IM)
    st = init_IM_table(file, header.mode, par, &table);
  else if (isApMode(header.mode))
    st = init_AP_table(file, header.mode, par, &table);
  else if (header.mode == ASAR_WS)
    st = init_WS_table(file, header.mode, par, *swaths, &table);
  else
    st = init_GM_table(file, header.mode, par, *swaths, &table);
  if (st != 0) return L0_CALLED(st);
  Walk walk(file, par, *swaths, conf);
  if (int w = walk.run(files, table); w != 0) return L0_CALLED(w);
  conf->done = true;
  return 0;
}

int extract_t0(const std::string& level0, double* t0) {
  Level0File file;
  if (int st = file.open(level0); st != 0) return L0_CALLED(st);
  Level0Header header;
  if (int st = read_level0_header(file, &header); st != 0) return L0_CALLED(st);
  long pos = kFirstPacketOffset;
  PacketHead h;
  while (nextTrustedHead(file, header.mode, pos, h, 1)) {
    if (h.isEcho()) {
      *t0 = h.seconds85();
      return 0;
    }
    pos += h.packetBytes();
  }
  return L0_FAIL("File reading failed! " + level0 + ": no echo packet", STATUS_READ_FAILED);
}

int fill_enviinfo(const std::string& level0, DataSetInfo_Obj* info) {
  Level0File file;
  if (int st = file.open(level0); st != 0) return L0_CALLED(st);
  Level0Header h;
  if (int st = read_level0_header(file, &h); st != 0) return L0_CALLED(st);
  info->SceneID = h.productName;
  info->OrbitNumber = h.orbitNumber;
  info->Track = h.track;
  info->SenseDate = h.sensingStart;
  info->OrbitConfiguration = h.stopLat < h.startLat ? "DESCENDING" : "ASCENDING";
  info->StampProcessingDate();
  return 0;
}
