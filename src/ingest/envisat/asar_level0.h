#pragma once
// ASAR level-0 products: the main and specific headers, the instrument
// source packets with their 68-byte heads, the timeline of the packets the
// instrument sent, and the walk that turns the packets into raw rasters
// with repaired gaps.
#include <cstdint>
#include <string>
#include <vector>

#include "base/mapped_file.h"
#include "ingest/envisat/asar_records.h"
#include "product/time_base.h"

class DataSetInfo_Obj;

inline constexpr long kLevel0MphBytes = 1247;
inline constexpr long kLevel0SphBytes = 1956;
inline constexpr long kFirstPacketOffset = kLevel0MphBytes + kLevel0SphBytes;  // 3203
inline constexpr int kPacketHeadBytes = 68;
inline constexpr int kDataFieldHeaderBytes = 29;
inline constexpr long kSyncWindow = 600000;
inline constexpr int kUntrustedScore = 12;
inline constexpr double kChirpBandStep = 62745.098039215685;  // Hz for each chirp band code

// A level-0 product mapped read-only; a truncated file is simply shorter.
class Level0File {
 public:
  // 0, 9 "File not opened!" or 4 "File reading failed!" (reported).
  int open(const std::string& path);
  const std::string& path() const { return path_; }
  long size() const { return static_cast<long>(map_.size()); }
  const unsigned char* data() const { return map_.data(); }
  bool has(long offset, long bytes) const { return offset >= 0 && bytes >= 0 && offset + bytes <= size(); }

 private:
  std::string path_;
  MappedFile map_;
};

// Fields of the main and specific product headers that the extraction reads.
struct Level0Header {
  std::string productName;   // MPH 9, 62 bytes
  std::string orbitNumber;   // MPH 58, 5 bytes
  std::string sensingStart;  // MPH SENSING_START
  std::string sensingStop;   // MPH SENSING_STOP
  std::string modeName;      // SPH 20, up to 3 bytes
  double startLat = 0.0;     // SPH 56, micro-degrees
  double stopLat = 0.0;      // SPH 120, micro-degrees
  std::string track;         // SPH 184, 15 bytes: the SAT_TRACK value
  std::string polarisation;  // SPH 775, 5 bytes
  std::string swathName;     // SPH 789, 3 bytes
  long records = 0;          // SPH 1044, 10 bytes
  int mode = -1;             // AsarMode, -1 when not recognised
};
// 0, 9, 4 or 1 with "UNRECOGNIZED type!" when the SPH names no known mode.
int read_level0_header(const Level0File& file, Level0Header* header);

// The fields of a packet head that the extraction uses.
struct PacketHead {
  mjd time;                // acquisition time
  int applicationId = 0;   // low 11 bits at 32
  int sequenceCount = 0;   // low 14 bits at 34
  int packetLength = 0;    // at 36
  int dataHeaderLength = 0;
  int modeId = 0;
  int modeCounter = 0;     // 24 bits at 48
  int swathCode = 0;       // high 6 bits of byte 51
  int typeFlags = 0;       // byte 52
  int cyclePacket = 0;     // 12 bits at 52
  int priCode = 0, swstCode = 0, swlCode = 0;
  int polarisationBits = 0;  // bits 6 and 5 of byte 61
  int calibrationRow = 0;    // low 5 bits of byte 61
  int pulseLengthCode = 0;   // 10 bits at 62
  int chirpBandCode = 0;     // byte 64
  long dataBytes() const { return long(packetLength) - kDataFieldHeaderBytes; }
  long packetBytes() const { return kPacketHeadBytes + dataBytes(); }
  bool isEcho() const { return (typeFlags & 0x80) != 0; }
  double seconds85() const { return mjd2sec85(time); }
};
PacketHead parse_packet_head(const unsigned char* p);
// Score of a head for the mode: 0 when perfect, 12 or more when it cannot
// be trusted (reports the last fault at level 1 while reports are on).
int checkheader(const PacketHead& head, int mode);
// The lowest offset from `from` at which a perfect head stands, searched in
// 600000 bytes; the end of that window when there is none. Silent.
long synchromdsr(const Level0File& file, long from, int mode);

// First pass over the first 1000 packets: counts of swaths and the most
// frequent codes of each swath, then the INS constants (asainspar).
int loadparam(const Level0File& file, const char* ins, int mode, sarpar* par, int* swaths);

// Timeline of the packets the instrument sent.
struct TimelineRow {
  std::uint16_t kind = 0;   // bits 0-1: 0 echo, 1 calibration, 2 noise, 3 other; +4 requested,
                            // +16 not found, +32 first echo of a cycle, +64 last echo of a burst
  std::uint16_t swath = 0;  // 666/667: a gap for the pair is filled before the row
};
inline constexpr int kRowRequested = 4, kRowMissing = 16, kRowCycleStart = 32, kRowBurstEnd = 64;
struct Timeline {
  double step = 0.0;        // seconds between rows
  int rowsPerLine = 1;
  int lines = 0;            // rows from the first echo on
  int firstCycle = 0;
  int firstEchoCounter = 0;
  double startTime = 0.0, stopTime = 0.0;
  int firstCounter = 0, lastCounter = 0;
  int firstCyclePosition = 0;
  int firstPolarisation = 0;  // AP: polarisation bits of the first head
  int burstLength = 0;        // AP: echoes in a burst of one polarisation
  std::vector<TimelineRow> rows;
};
// First valid head from the first packet on and last complete echo from
// the end; 4 with a report when the product holds no complete echo.
int init_IM_table(const Level0File& file, int mode, const sarpar* par, Timeline* table);
int init_AP_table(const Level0File& file, int mode, const sarpar* par, Timeline* table);
int init_WS_table(const Level0File& file, int mode, const sarpar* par, int swaths, Timeline* table);
int init_GM_table(const Level0File& file, int mode, const sarpar* par, int swaths, Timeline* table);

// Inputs and outputs of one walk.
struct ExtractionFiles {
  std::string level0, ins, xca;
  std::vector<std::string> outputs;  // one raw raster for each swath
};
// The walk: timeline, decoding, repairs, rasters and the per-line vectors.
int envi_extract(const ExtractionFiles& files, sarpar* par, extconf* conf, int* swaths);
// Time of the first valid echo head, seconds since 1985.
int extract_t0(const std::string& level0, double* t0);
// Scene identification from the headers.
int fill_enviinfo(const std::string& level0, DataSetInfo_Obj* info);
