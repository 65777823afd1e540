#pragma once
// ERS-1/2: the focuser of a level-0 scene (CEOS leader and image file) and
// the sensor's line of the registry.
#include <memory>
#include <string>
#include <vector>

#include "focus/sensor_registry.h"
#include "focus/sensors/level0_chain.h"

class ATERSExtractor;

class ersLevel0Focuser : public level0SceneFocuser {
 public:
  ersLevel0Focuser();
  ~ersLevel0Focuser() override;

  int finalize() override;
  int preprocessing() override;
  int postprocessing() override;
  int finalize_modular() override;

  std::string LEAFilename;  // CEOS leader file
  ATERSExtractor* extractor() { return extractor_.get(); }

 private:
  int nameStages() override;
  bool hasExtractor() const override { return extractor_ != nullptr; }
  int extract() override;
  void redirectExtraction(const std::string& raw, const std::string& chirp,
                          const std::string& antenna) override;
  void prepareModularExtraction() override;
  std::unique_ptr<ATERSExtractor> extractor_;
};

// Directory part of a scene path, where the product's leader and the orbit
// look-up start: everything before the last '/' or '\\'; empty for a path
// without separator.
std::string scenePathDirectory(const std::string& path);

// The registry line of "ERS".
extern const SensorDriver kErsSensor;
