#pragma once
// The sensors a job can name. One line per platform string of job parameter
// 0 says everything the job driver, the multi-platform focuser and product
// finishing need to know about the sensor; none of them compares platform
// strings. A sensor is added by writing its line in sensor_registry.cpp.
#include <memory>
#include <string>
#include <vector>

#include "focus/job_fields.h"

class stripmapGeneralFocuser;

// Export tag and companion file of a finished single-scene product.
struct FinishingTag {
  int tag = -1;        // KT_* of the header export; -1 for no export
  std::string second;  // second file handed to the export (ASA_XCA, ERSDAC orbit)
};

// A temporary file of a job and, where its erasure is announced, the
// checkpoint reported after the removal.
struct TemporaryFile {
  std::string name;
  std::string announce{};
};

struct SensorDriver {
  const char* platform;  // job parameter 0, exact
  // Name of the parameter profile for the job (a file of the description
  // files folder) and whether it is an alternating-polarisation one; 1 after
  // a report when the scene's product type has no profile.
  int (*profile)(const FocuserJobFields& job, std::string& profile, int& alternating);
  // The sensor focuser for the job; null where this build has none for the
  // sensor.
  std::unique_ptr<stripmapGeneralFocuser> (*makeFocuser)(const FocuserJobFields& job);
  // Hands the job's scene and auxiliary files to the focuser (null when the
  // sensor has none), looking up the files given only as a folder; 10 with
  // the report when a needed file is neither given nor found.
  int (*fill)(FocuserJobFields& job, stripmapGeneralFocuser* focuser);
  // Tests after the fill and the common fields; 10 when something the
  // sensor needs is missing.
  int (*check)(const FocuserJobFields& job, const stripmapGeneralFocuser* focuser);
  // The chain's temporary files of the job, in the order in which the job
  // erases them.
  std::vector<TemporaryFile> (*temporaryFiles)(const FocuserJobFields& job);
  // Export tag of a single-scene product; `parameters` is the job.
  FinishingTag (*finishingTag)(const FocuserJobFields& job,
                               const std::vector<std::string>& parameters);
  // Family named in the refusal when the build has no focuser for it.
  const char* family;
  // Auxiliary files 2 to 4 given by neither name nor folder are looked for
  // among the description files.
  bool auxiliaryInDescriptionFiles;
  // Scenes of further polarisations give one finished product each.
  bool multiFileProducts;
  // ... and each of them its GeoTIFF on request.
  bool multiFileGeoTiff;
};

// The line of `platform`, or null for a name no sensor has.
const SensorDriver* findSensor(const std::string& platform);
