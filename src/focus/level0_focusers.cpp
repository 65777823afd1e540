#include "focus/level0_focusers.h"

#include "diag/report.h"

// The extractor's class is completed once the ERS ingest lands.
class ATERSExtractor {};

ersLevel0Focuser::ersLevel0Focuser() = default;
ersLevel0Focuser::~ersLevel0Focuser() = default;
int ersLevel0Focuser::initialize() { return 1; }
int ersLevel0Focuser::finalize() { return 0; }
int ersLevel0Focuser::ingestion(const std::string&, const std::string&, const std::string&) {
  return 1;
}
int ersLevel0Focuser::ingestion() { return 1; }
int ersLevel0Focuser::preprocessing() { return 0; }
int ersLevel0Focuser::postprocessing() { return 0; }
int ersLevel0Focuser::initialize_modular() { return 1; }
int ersLevel0Focuser::finalize_modular() { return 0; }
int ersLevel0Focuser::nameStages() { return 0; }

envisatLevel0Focuser::envisatLevel0Focuser() = default;
envisatLevel0Focuser::~envisatLevel0Focuser() = default;
int envisatLevel0Focuser::initialize() { return 1; }
int envisatLevel0Focuser::ingestion(const std::string&, const std::string&, const std::string&) {
  return 1;
}
int envisatLevel0Focuser::ingestion() { return 1; }
int envisatLevel0Focuser::preprocessing() { return 0; }
int envisatLevel0Focuser::postprocessing() { return 0; }
int envisatLevel0Focuser::initialize_modular() { return 1; }
int envisatLevel0Focuser::nameStages() { return 0; }

radarsatLevel0Focuser::radarsatLevel0Focuser() = default;
radarsatLevel0Focuser::~radarsatLevel0Focuser() = default;
int radarsatLevel0Focuser::initialize() { return 1; }
int radarsatLevel0Focuser::finalize() { return 0; }
int radarsatLevel0Focuser::ingestion(const std::string&, const std::string&, const std::string&) {
  return 1;
}
int radarsatLevel0Focuser::ingestion() { return 1; }
int radarsatLevel0Focuser::preprocessing() { return 0; }
int radarsatLevel0Focuser::postprocessing() { return 0; }
int radarsatLevel0Focuser::initialize_modular() { return 1; }
int radarsatLevel0Focuser::finalize_modular() { return 0; }
int radarsatLevel0Focuser::nameStages() { return 0; }

int configureLevel0Chain(SARFocuser_conf&, const std::string&, bool) { return 1; }
