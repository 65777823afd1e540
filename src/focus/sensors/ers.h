#pragma once
// ERS-1/2: the focuser of a level-0 scene (CEOS leader and image file) and
// the sensor's line of the registry.
#include <memory>
#include <string>
#include <vector>

#include "focus/sensor_registry.h"
#include "focus/stripmap_general_focuser.h"

class ATERSExtractor;

class ersLevel0Focuser : public stripmapGeneralFocuserModular {
 public:
  ersLevel0Focuser();
  ~ersLevel0Focuser() override;

  int initialize() override;
  int finalize() override;
  int ingestion(const std::string& raw, const std::string& chirp,
                const std::string& antenna) override;
  int ingestion() override;
  int preprocessing() override;
  int postprocessing() override;
  int initialize_modular() override;
  int finalize_modular() override;

  std::string LEAFilename;  // CEOS leader file
  ATERSExtractor* extractor() { return extractor_.get(); }

 private:
  int nameStages();
  std::unique_ptr<ATERSExtractor> extractor_;
};

// Directory part of a scene path, where the product's leader and the orbit
// look-up start: everything before the last '/' or '\\'; empty for a path
// without separator.
std::string scenePathDirectory(const std::string& path);

// The registry line of "ERS".
extern const SensorDriver kErsSensor;
