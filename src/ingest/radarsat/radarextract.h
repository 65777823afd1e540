#pragma once
// RADARSAT-1 CEOS product extraction: reads the leader (date, orbit
// configuration, state vectors) and the signal data file, and writes the raw
// raster (each line prefixed with its sampling window start as a 32-bit
// float) with its ".hdr" and the chirp file made of the replica the lines
// carry.
#include <fstream>
#include <string>
#include <vector>

#include "product/data_set_info.h"
#include "product/product_aggregates.h"

class radarextract {
 public:
  // The three profile sections into the fields; 10 when a required key is
  // missing.
  int readpar(const std::string& file);
  int checkpar() const;
  // raw data: RADARExtract(); SLC product: extractSLC(). productLevel keeps
  // what checklevel() found.
  int run();
  int productLevel = 0;
  // 1 for an SLC product, 0 for raw; 9 or 4 when the leader cannot be read.
  int checklevel();
  int RADARExtract();
  int extractSLC();
  // Kind of OrbitFile: 1 a CEOS leader with at least five state vectors, 2
  // a RADARSAT text orbit file, 0 none. Status 1 when the leader holds too
  // few vectors or the file is of no known kind.
  int orbit_source(int* source);
  int getOrbitConf(const std::string& leader, DataSetInfo_Obj* info);
  // Seconds since 1985 of a line: midnight of the leader's scene date plus
  // the seconds of the day of the line.
  int getTime(double secondsOfDay, double* sec85) const;
  // State vectors of a CEOS leader into the record's orbit, Earth-fixed and
  // in m and m/s.
  int readLeaderVectors(const std::string& leader);
  // The vectors of the platform position record: first time, interval,
  // x y z per vector, Earth-fixed, in m and m/s.
  int leaderVectors(const std::string& leader, double& t0, double& interval, std::vector<double>& pos,
                    std::vector<double>& vel) const;

  const std::vector<float>& getSwstVector() const { return swstVector; }
  const std::vector<int>& getSequenceVector() const { return sequenceVector; }

  std::string ReportFilename = "RadarExtract.txt";
  int LinesToSkip = 0;
  int LinesToExtract = 0;  // 0: every line after the skipped ones
  std::string LeaderFile;
  std::string DataFile;
  std::string OrbitFile;
  std::string OutputRawFile;
  std::string OutputChirpFile;  // empty: no chirp written

  GeneralRAWData rawData;
  // Per output line: window start (s) and the line number of its record
  // (0 for a line filled in for a missing one).
  std::vector<float> swstVector;
  std::vector<int> sequenceVector;
  int missingLines = 0;
  int replicaLines = 0;
  int gainChanges = 0;
  int windowChanges = 0;

 private:
  int readSceneDate();
  // Leader date, orbit configuration and source; the data file opened past
  // its descriptor, with its record count and length; the part to extract
  // checked against them.
  int openProduct(std::ifstream& in, int& source, int& records, int& recordLength);
  // The output raster's layout in the record.
  ::DataFile& outputRaster(int samples, int lines, int prefix);
  // Common fields of the record, the orbit of the source, the ".hdr".
  int finishRecord(int source);
  int writeChirp(const std::vector<float>& replica, int samples);
  double sceneMidnight_ = -1.0;
};
