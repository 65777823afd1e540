#pragma once
// ALOS PALSAR level-1.0 focusers: one scene, several polarisations of one
// acquisition (JAXA), and the ERSDAC layout. Further polarisations are
// focused with the Doppler centroid and rate of the first product, so that
// all channels share one geometry and no second estimation runs.
#include <memory>
#include <string>
#include <vector>

#include "focus/stripmap_general_focuser.h"

class ATPalExtractor;

class palsarLevel0Focuser : public stripmapGeneralFocuserModular {
 public:
  palsarLevel0Focuser();
  ~palsarLevel0Focuser() override;

  int initialize() override;
  int finalize() override { return 0; }
  int ingestion(const std::string& raw, const std::string& chirp, const std::string& antenna) override;
  int ingestion() override;
  int preprocessing() override;
  int postprocessing() override;

  std::string leaderFilename;
  std::string secondScene, thirdScene, fourthScene;  // further polarisations (image files)
  int sceneCount = 1;
  int currentScene = 0;
  int Remove_interferences = 1;
  ATPalExtractor* extractor() { return extractor_.get(); }
  // Doppler estimations run so far (the chain's centroid stage).
  int dopplerEstimations() const { return dopplerEstimations_; }

 protected:
  // Names of the stage rasters of a scene: root "<out>" (single scene) or
  // "<out>_<label>" (one of several).
  int nameStages(const std::string& scene, const std::string& root);
  int readConfiguration();
  std::string sceneName(int index) const;
  bool initialized_ = false;
  int dopplerEstimations_ = 0;
  std::unique_ptr<ATPalExtractor> extractor_;
};

// Several polarisations of a JAXA product, one image file each: the first
// scene as usual, every further one through initializeUsingDoppler.
class palsarMultiPolLevel0Focuser : public palsarLevel0Focuser {
 public:
  int initialize() override;
  int run() override;
  // Next scene, with the Doppler centroid and rate of the product whose
  // record is `header`: Flag_dcest 0.
  int initializeUsingDoppler(const std::string& header);
};

// ERSDAC products: like the multi-polarisation focuser, with at most two
// scenes in a run.
class palsarErsDacLevel0Focuser : public palsarMultiPolLevel0Focuser {
 public:
  int initialize() override;
};

// Label of a PALSAR polarisation code: hh, hv, vh, vv, or "1".
std::string palsarPolarisationLabel(int code);
