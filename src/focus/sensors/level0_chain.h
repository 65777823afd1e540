#pragma once
// Chain set-up and stages shared by the focusers of single level-0 scenes.
#include <string>

#include "focus/sar_focuser.h"
#include "focus/stripmap_general_focuser.h"

// Profile Memory of section "sarfocuserConfiguration" (256 when absent) and
// the chain's configuration read from the profile with the fixed values of
// single scenes. `announceDefault` reports the default at level 1.
int configureLevel0Chain(SARFocuser_conf& conf, const std::string& profile, bool announceDefault);

// Names the stage rasters of a scene whose products start with `root`
// ("<root>.extracted", ".chirp", ".rgfoc", the antenna pattern
// "<root><antennaSuffix>" or none when the suffix is empty) and hands them to
// the chain, which reads the antenna pattern only when `chainUsesAntenna`.
void nameLevel0Stages(FocuserWork& work, SARFocuser& chain, const std::string& root,
                      const std::string& antennaSuffix, bool chainUsesAntenna);

// Records of the extracted rasters into the work object (the antenna's only
// with `withAntenna`).
int readWorkRecords(FocuserWork& work, bool withAntenna);

// The call-tree report; returns status.
int level0CalledError(int status);

// The stages of a focuser of one level-0 scene through one extractor. The
// sensor checks its auxiliary names and hands the file names to its
// extractor and the chain (nameStages), and runs its extractor (extract);
// the order of the stages, the chain set-up and the reading of the extracted
// records are the same for every sensor.
class level0SceneFocuser : public stripmapGeneralFocuserModular {
 public:
  // Base checks, nameStages, the chain's configuration from the profile,
  // "Initialization completed".
  int initialize() override;
  // The same for modular working: prepareModularExtraction and the
  // configuration document instead of the profile block.
  int initialize_modular() override;
  // 1 when an output name was selected; otherwise the extraction writes to
  // these names.
  int ingestion(const std::string& raw, const std::string& chirp,
                const std::string& antenna) override;
  // "Starting ingestion", the extractor's run, the records of what it wrote,
  // then the sensor's message.
  int ingestion() override;

 protected:
  struct StageTexts {
    const char* extractorMissing;  // level 0 when the extractor is not there
    const char* extracted;         // level 2 after the records are read
    bool announceMemoryDefault;    // report the default Memory of the profile
  };
  explicit level0SceneFocuser(StageTexts texts) : texts_(texts) {}

  virtual int nameStages() = 0;
  // The checks of a CEOS leader before naming the stages: "LEA filename not
  // selected!", the extractor's message, "LEA file does not exist!"; 1 with
  // the first that fails.
  int checkLeader(const std::string& leader) const;
  virtual bool hasExtractor() const = 0;
  // The extractor's checks and run, each failure with the call-tree report.
  virtual int extract() = 0;
  // The extractor's output names, for an ingestion to given names.
  virtual void redirectExtraction(const std::string& raw, const std::string& chirp,
                                  const std::string& antenna) = 0;
  // Extractor set-up of modular working, before the configuration is read.
  virtual void prepareModularExtraction() {}
  // Records of the extracted rasters into the work object.
  virtual int readRecords() { return readWorkRecords(work, false); }

 private:
  StageTexts texts_;
};
