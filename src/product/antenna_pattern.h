#pragma once
// Elevation antenna pattern of a product: start angle and step in degrees,
// the samples (linear amplitude) and the one-line raster that holds them.
#include <string>
#include <vector>

#include "product/data_file.h"
#include "product/general_sar_base.h"

class AntennaPattern_Obj : public GeneralSAR_Base {
 public:
  AntennaPattern_Obj();
  AntennaPattern_Obj(const AntennaPattern_Obj& other);
  AntennaPattern_Obj& operator=(const AntennaPattern_Obj& other);

  // Allocates PatternSamples values (nothing, and no refresh of the table,
  // when the count is not above 0). 7 when memory is out.
  int createBuffers() override;
  int destroyBuffers() override;
  void refreshParameters() override;

  // Element document "AntennaPattern" into file.
  int writehdr(const std::string& file) override;
  // Header of the pattern raster: its raster header, then the element
  // document into "<raster>.hdr".
  int writehdr() override;
  // Element document, else profile section "AntennaPattern"; then the raster
  // named by file less its last 4 characters gives PatternSamples.
  int readhdr(const std::string& file) override;
  void clone(AntennaPattern_Obj* target) const;

  // Pattern of swath and polarisation from an ASAR external calibration
  // product: 201 samples 0.05 degrees apart starting 5 degrees below the
  // swath's boresight elevation. 9 / 4 on file failures, 10 for an entry
  // outside the table.
  int getPatternENVI(const std::string& file, int swath, int polarisation);
  // The samples into buffer: read from the raster the first time (when the
  // array holds no pattern yet), from the array afterwards.
  int getPatternArray(float* buffer);
  // Writes the samples as a one-line FLOAT32 raster named patternFile.filename.
  int WritePatternArray();

  double StartAngle = -999.0;  // degrees
  double DeltaAngle = -999.0;  // degrees
  int PatternSamples = -999;
  DataFile patternFile;
  std::vector<float> Pattern;
};
