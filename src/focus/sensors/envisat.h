#pragma once
// ENVISAT ASAR: the focuser of a level-0 product (image mode and alternating
// polarisation) through enviextractor, with the auxiliary files ASA_INS,
// ASA_XCA and ASA_XCH of the scene, and the sensor's line of the registry.
#include <memory>
#include <string>

#include "focus/sensor_registry.h"
#include "focus/stripmap_general_focuser.h"

class enviextractor;

class envisatLevel0Focuser : public stripmapGeneralFocuserModular {
 public:
  envisatLevel0Focuser();
  ~envisatLevel0Focuser() override;

  int initialize() override;
  int finalize() override { return 0; }
  int ingestion(const std::string& raw, const std::string& chirp,
                const std::string& antenna) override;
  int ingestion() override;
  int preprocessing() override;
  int postprocessing() override;
  int initialize_modular() override;
  int finalize_modular() override { return 0; }

  std::string ASA_INSFilename;
  std::string ASA_XCAFilename;
  std::string ASA_XCHFilename;
  enviextractor* extractor() { return extractor_.get(); }

 private:
  int nameStages();
  std::unique_ptr<enviextractor> extractor_;
};

// The registry line of "ENVISAT".
extern const SensorDriver kEnvisatSensor;
