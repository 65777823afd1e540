#pragma once
// ENVISAT ASAR: the focuser of a level-0 product (image mode and alternating
// polarisation) through enviextractor, with the auxiliary files ASA_INS,
// ASA_XCA and ASA_XCH of the scene, and the sensor's line of the registry.
#include <memory>
#include <string>

#include "focus/sensor_registry.h"
#include "focus/sensors/level0_chain.h"

class enviextractor;

class envisatLevel0Focuser : public level0SceneFocuser {
 public:
  envisatLevel0Focuser();
  ~envisatLevel0Focuser() override;

  int finalize() override { return 0; }
  int preprocessing() override;
  int postprocessing() override;
  int finalize_modular() override { return 0; }

  std::string ASA_INSFilename;
  std::string ASA_XCAFilename;
  std::string ASA_XCHFilename;
  enviextractor* extractor() { return extractor_.get(); }

 private:
  int nameStages() override;
  bool hasExtractor() const override { return extractor_ != nullptr; }
  int extract() override;
  void redirectExtraction(const std::string& raw, const std::string& chirp,
                          const std::string& antenna) override;
  void prepareModularExtraction() override;
  int readRecords() override;
  std::unique_ptr<enviextractor> extractor_;
};

// The registry line of "ENVISAT".
extern const SensorDriver kEnvisatSensor;
