#pragma once
// Sensor focusers of single stripmap scenes: each owns its extractor and
// points the focusing chain at the rasters that the extractor writes.
#include <memory>
#include <string>

#include "focus/stripmap_general_focuser.h"

class ATERSExtractor;
class radarextract;

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

// ASAR level 0; its extractor is not part of this build, so ingestion fails
// with a report.
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

// RADARSAT-1 level 0: CEOS leader and signal data file.
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

// Profile Memory of section "sarfocuserConfiguration" (256 when absent) and
// the chain's configuration read from the profile with the fixed values of
// single scenes. `announceDefault` reports the default at level 1.
int configureLevel0Chain(SARFocuser_conf& conf, const std::string& profile, bool announceDefault);
