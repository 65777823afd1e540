#pragma once
// Profile companions of the RADARSAT extractor: sections
// "radarextractConfiguration", "radarextractInput" and "radarextractOutput".
#include <string>

#include "product/product_aggregates.h"

struct radarextract_conf {
  std::string ReportFilename = "RadarExtract.txt";
  int readpar(const std::string& file);
  int checkpar() const;
};

struct radarextract_input {
  int LinesToSkip = 0;
  int LinesToExtract = 0;
  std::string LeaderFile;
  std::string DataFile;
  std::string OrbitFile;
  int readpar(const std::string& file);
  // 10 with a report naming the key when the leader or data file is not given.
  int checkpar() const;
};

struct radarextract_output {
  std::string OutputRawFile;
  std::string OutputChirpFile;
  int readpar(const std::string& file);
  int checkpar() const;
  // The record's header, "<OutputRawFile>.hdr".
  int writepar(GeneralRAWData& record) const;
};
