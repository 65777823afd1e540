#pragma once
// ENVISAT ASAR: the focuser of a level-0 product (image mode and alternating
// polarisation) and the sensor's line of the registry. The ASAR extractor is
// not part of this build, so the focuser stops at its stages with a report.
#include <string>

#include "focus/sensor_registry.h"
#include "focus/stripmap_general_focuser.h"

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

 private:
  int nameStages();
};

// The registry line of "ENVISAT".
extern const SensorDriver kEnvisatSensor;
