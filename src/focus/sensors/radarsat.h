#pragma once
// RADARSAT-1: the focuser of a level-0 scene (CEOS leader and signal data
// file) through radarextract, and the sensor's line of the registry.
#include <memory>
#include <string>

#include "focus/sensor_registry.h"
#include "focus/stripmap_general_focuser.h"

class radarextract;

class radarsatLevel0Focuser : public stripmapGeneralFocuserModular {
 public:
  radarsatLevel0Focuser();
  ~radarsatLevel0Focuser() override;

  int initialize() override;
  int finalize() override;
  int ingestion(const std::string& raw, const std::string& chirp,
                const std::string& antenna) override;
  int ingestion() override;
  int preprocessing() override;
  int postprocessing() override;
  int initialize_modular() override;
  int finalize_modular() override;

  std::string leaderFilename;
  radarextract* extractor() { return extractor_.get(); }

 private:
  int nameStages();
  std::unique_ptr<radarextract> extractor_;
};

// The registry line of "RADARSAT".
extern const SensorDriver kRadarsatSensor;
