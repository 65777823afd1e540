#include <string>
#include <vector>

#include "focus/stripmap_general_focuser.h"
#include "focus_fixture.h"
#include "product/data_set_info.h"

namespace {

// A sensor focuser whose stages only record that they ran; one of them can
// be made to fail.
class RecordingFocuser : public stripmapGeneralFocuserModular {
 public:
  int initialize() override { return step("initialize", stripmapGeneralFocuser::initialize()); }
  int finalize() override { return step("finalize", 0); }
  int ingestion(const std::string& raw, const std::string&, const std::string&) override {
    return step("ingestion:" + raw, 0);
  }
  int ingestion() override { return step("ingestion", 0); }
  int preprocessing() override { return step("preprocessing", 0); }
  int postprocessing() override { return step("postprocessing", 0); }

  int step(const std::string& name, int status) {
    stages.push_back(name);
    const std::string base = name.substr(0, name.find(':'));
    return base == failAt ? failStatus : status;
  }
  std::vector<std::string> stages;
  std::string failAt;
  int failStatus = 0;
};

class StageTemplate : public FocusTest {
 protected:
  void SetUp() override {
    FocusTest::SetUp();
    writeText(path("scene.dat"), "x");
    writeText(path("orbit.txt"), "x");
    writeText(path("profile.hdr"), "[sarfocuserConfiguration]\nMemory = 64\n");
  }
  void fill(stripmapGeneralFocuser& f) {
    f.level0Filename = path("scene.dat");
    f.orbitFilename = path("orbit.txt");
    f.configurationFilename = path("profile.hdr");
    f.outputFilename = path("out");
  }
};

TEST_F(StageTemplate, InitializeChecksNamesAndFilesInOrder) {
  struct Case {
    std::string field;
    std::string value;
    std::string message;
  };
  const std::vector<Case> cases = {
      {"scene", "", "Data filename not selected!"},
      {"orbit", "", "Orbit filename not selected!"},
      {"conf", "", "Processing conf not selected!"},
      {"orbit", "missing_orbit", "orbit file does not exist!"},
      {"scene", "missing_scene", "data file does not exist!"},
      {"conf", "missing_profile", "processing configuration file does not exist!"},
      {"skip", "-1", "skip lines <0!"},
      {"extract", "-1", "extract lines <0!"},
  };
  for (const Case& c : cases) {
    RecordingFocuser f;
    fill(f);
    const std::string v = c.value.empty() ? "" : path(c.value);
    if (c.field == "scene") f.level0Filename = v;
    if (c.field == "orbit") f.orbitFilename = v;
    if (c.field == "conf") f.configurationFilename = v;
    if (c.field == "skip") f.skipLines = -1;
    if (c.field == "extract") f.extractLines = -1;
    EXPECT_EQ(f.initialize(), 1) << c.message;
    EXPECT_TRUE(traced(c.message)) << c.message;
  }
  // Every check failed on its own message, never on an earlier one.
  const std::string t = trace();
  EXPECT_EQ(t.find("Data filename not selected!"), t.rfind("Data filename not selected!"));

  RecordingFocuser ok;
  fill(ok);
  ok.conf().Flag_set = 1;
  EXPECT_EQ(ok.initialize(), 0);
  EXPECT_TRUE(ok.outputSelected());
  EXPECT_EQ(ok.conf().Flag_set, 0);  // cleared at the end

  // A scene directory passes the test.
  RecordingFocuser dir;
  fill(dir);
  dir.level0Filename = working_;
  dir.outputFilename.clear();
  EXPECT_EQ(dir.initialize(), 0);
  EXPECT_FALSE(dir.outputSelected());
}

TEST_F(StageTemplate, RunCallsStagesInOrderAndStopsAtTheFirstFailure) {
  // Every stage passes; the chain then finds no raw raster and gives 10.
  {
    startReports_ = false;
    set_flg_report(0);  // the missing raw raster is fatal while reports are on
    RecordingFocuser f;
    fill(f);
    EXPECT_EQ(f.run(), 10);
    EXPECT_EQ(f.stages, (std::vector<std::string>{"initialize", "ingestion", "preprocessing"}));
    EXPECT_EQ(f.conf().Flag_set, 1);
    EXPECT_EQ(f.conf().Verbose, 1);
    set_flg_report(1);
  }
  for (const std::string failing : {"ingestion", "preprocessing"}) {
    RecordingFocuser f;
    fill(f);
    f.failAt = failing;
    f.failStatus = 7;
    EXPECT_EQ(f.run(), 7) << failing;
    EXPECT_EQ(f.stages.back(), failing);
    EXPECT_EQ(f.conf().Flag_set, 0) << "the chain must not be armed";
  }
  {
    RecordingFocuser f;
    fill(f);
    f.initialize();
    f.stages.clear();
    f.failAt = "initialize";
    f.failStatus = 4;
    EXPECT_EQ(f.run(), 4);
    EXPECT_EQ(f.stages, std::vector<std::string>{"initialize"});
  }
}

}  // namespace
