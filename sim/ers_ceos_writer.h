#pragma once
// Writers of the ERS level-0 files in CEOS layout (leader, image file,
// volume directory and null volume files) and of the DEOS precise orbit arcs
// with their `arclist`. Record sizes, record heads and field positions follow
// the archive products; values are formatted so that the fixed-field readers
// of the extractor read them back.
#include <cstdint>
#include <string>
#include <vector>

#include "ingest/ers/ers_ceos_layout.h"
#include "sim/sim_geometry.h"

// CEOS record head: sequence number, four type bytes, record length (all
// big-endian).
void putCeosRecordHead(char* rec, std::uint32_t sequence, const unsigned char type[4], std::uint32_t length);
// Writes text into a fixed field, left-aligned and blank-padded; a text
// longer than the field throws std::length_error naming the offset.
void putText(char* rec, int offset, int width, const std::string& text);
// printf-formatted value that must fill exactly `width` characters (shorter
// results are right-aligned); a wider result throws std::length_error.
void putFormat(char* rec, int offset, int width, const char* format, double value);
void putInt(char* rec, int offset, int width, const char* format, long value);
// The same on a field of a layout table.
void putText(char* rec, CeosField field, const std::string& text);
void putFormat(char* rec, CeosField field, const char* format, double value);
void putInt(char* rec, CeosField field, const char* format, long value);
void putBE32(char* p, std::uint32_t v);
void putBE16(char* p, std::uint16_t v);

// Values of the leader file. Unset reals of the format are -9999999.9999999.
struct ErsLeaderInfo {
  std::string mission = "ERS2";              // "ERS1" or "ERS2"
  std::string software = "SIM-ERS-1.0";       // file descriptor software version (12 characters)
  std::string sceneDesignator = "ORBIT=00000-FRAME=0000";
  double sceneCentreTime = 0.0;               // seconds since 1985
  double sceneCentreLat = 0.0, sceneCentreLon = 0.0;  // degrees
  std::string ellipsoid = "WGS84";
  double semiMajorKm = 6378.137, semiMinorKm = 6356.7523;
  int centreLine = 0, centrePixel = 0;
  double sceneLengthKm = 0.0, sceneWidthKm = 0.0;
  std::string polarisation = "VV";
  int orbitNumber = 0;
  double platformLat = 0.0, platformLon = 0.0, platformHeading = 0.0;
  double incidenceDeg = 23.0;
  double radarFreqGHz = 5.3;
  double wavelength = 0.056666;
  double chirpCoefficient = 2.08894e11;   // third phase coefficient, Hz/s / 2
  double samplingRateMHz = 18.962468;
  double pulseLengthUs = 37.12;
  double biasI = -9999999.9999999, biasQ = -9999999.9999999;
  double mechanicalBoresightDeg = 20.355;
  double prf = 1679.902;
  std::string facility = "SIM-PAF";
  double lineSpacing = 3.977, pixelSpacing = 7.904;  // m
  double firstRangeTimeMs = -9999999.9999999, centreRangeTimeMs = -9999999.9999999,
         lastRangeTimeMs = -9999999.9999999;
  double firstLineTime = 0.0, centreLineTime = 0.0, lastLineTime = 0.0;  // seconds since 1985
  // Platform position record: vectors at firstVectorTime + k interval.
  double firstVectorTime = 0.0;
  double vectorInterval = 1.0;
  std::vector<StateVector> vectors;
};

// The whole leader file: file descriptor (720), data set summary (1886),
// platform position (386 + 132 per vector), two facility records (12288).
std::vector<char> buildErsLeader(const ErsLeaderInfo& info);
inline constexpr int kErsDssOffset = ers_leader::kDataSetSummary;
inline constexpr int kErsPprOffset = ers_leader::kPlatformPosition;

// Image file.
inline constexpr int kErsImageDescriptorSize = ers_image::kDescriptorLength;
inline constexpr int kErsDataPrefix = ers_image::kDataPrefix;
std::vector<char> buildErsImageDescriptor(const std::string& mission, const std::string& software,
                                          int records, int samples);
// One data record of 412 + 2 * samples bytes; iq holds I, Q bytes per sample.
void buildErsDataRecord(char* rec, std::uint32_t sequence, std::uint32_t lineNumber, int samples,
                        std::uint16_t swstCode, std::uint16_t priCode, std::uint32_t formatCounter,
                        const unsigned char* iq);

// Volume directory and null volume files of the product directory.
std::vector<char> buildErsVolumeDirectory(const std::string& mission, const std::string& facility,
                                          int orbitNumber, double firstLineTime, int records,
                                          int samples);
std::vector<char> buildErsNullVolume(const std::string& facility);

// DEOS ODR arc. Records are 60 s apart from firstTime; lat/lon in degrees,
// height in metres (stored as degrees x 1e7 with "xODR", x 1e6 with "@ODR",
// height in millimetres).
struct OdrPoint {
  double latDeg = 0.0, lonDeg = 0.0, height = 0.0;
};
std::vector<char> buildDeosOdr(const std::string& satellite, bool xodr, int arcNumber,
                               std::int32_t headerTime, std::int32_t firstTime,
                               const std::vector<OdrPoint>& points);

// `arclist` of an orbit archive: a 22-line head and one line per arc; the
// arc is valid between start and end (seconds since 1985, whole minutes).
struct ArcEntry {
  int number = 0;
  double start = 0.0, end = 0.0;
};
std::string buildArclist(const std::vector<ArcEntry>& arcs);
