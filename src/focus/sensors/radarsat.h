#pragma once
// RADARSAT-1: the focuser of a level-0 scene (CEOS leader and signal data
// file) through radarextract, and the sensor's line of the registry.
#include <memory>
#include <string>

#include "focus/sensor_registry.h"
#include "focus/sensors/level0_chain.h"

class radarextract;

class radarsatLevel0Focuser : public level0SceneFocuser {
 public:
  radarsatLevel0Focuser();
  ~radarsatLevel0Focuser() override;

  int finalize() override;
  int preprocessing() override;
  int postprocessing() override;
  int finalize_modular() override;

  std::string leaderFilename;
  radarextract* extractor() { return extractor_.get(); }

 private:
  int nameStages() override;
  bool hasExtractor() const override { return extractor_ != nullptr; }
  int extract() override;
  void redirectExtraction(const std::string& raw, const std::string& chirp,
                          const std::string& antenna) override;
  std::unique_ptr<radarextract> extractor_;
};

// The registry line of "RADARSAT".
extern const SensorDriver kRadarsatSensor;
