#include <gtest/gtest.h>

#include <filesystem>

#include "ingest/product_types.h"
#include "ingest/ers/ers_types.h"
#include "job/focusing_job.h"
#include "support/files.h"
#include "support/host_run.h"

using namespace support;

TEST(FocusingJob, FieldsFromTheParameters) {
  std::vector<std::string> p = basicJob("ERS", "/data/scene", "/tmp/out");
  p[2] = "/data/second";
  p[6] = "/orbits/ODR.007";
  p[11] = "/orbits";
  p[16] = "120";
  p[17] = "3000x";
  p[18] = "0";  // any text but NotOK switches erasing on
  FocuserJobFields f;
  fillFocuserFields(f, p, "/des/");
  EXPECT_EQ(f.platform, "ERS");
  EXPECT_EQ(f.level0Filename, "/data/scene");
  EXPECT_EQ(f.level0FilenameSecondPol, "/data/second");
  EXPECT_EQ(f.level0FilenameThirdPol, "");
  EXPECT_EQ(f.outputFilename, "/tmp/out");
  EXPECT_EQ(f.auxFile1, "/orbits/ODR.007");
  EXPECT_EQ(f.auxFile2, "");
  EXPECT_EQ(f.auxDirectory1, "/orbits");
  EXPECT_EQ(f.auxDirectory2, "NotOK");  // directories are copied as they stand
  EXPECT_EQ(f.skipLines, 120);
  EXPECT_EQ(f.extractLines, 3000);
  EXPECT_EQ(f.eraseTemporaryFiles, 1);
  EXPECT_EQ(f.Incore, 0);
  EXPECT_EQ(f.Verbose, 1);
  EXPECT_EQ(f.Memory, 256);
  EXPECT_EQ(f.ReportFilename, "ATmultiplatformFocuser.report");
  p[18] = "NotOK";
  fillFocuserFields(f, p, "/des/");
  EXPECT_EQ(f.eraseTemporaryFiles, 0);

  // ENVISAT: directories 2 to 4 with neither file nor folder given become
  // the description-file folder; 1 and 5 never do.
  p = basicJob("ENVISAT", "/data/asar.N1", "/tmp/out");
  p[8] = "/aux/xca";   // file 3 given
  p[14] = "/aux/xch";  // folder 4 given
  fillFocuserFields(f, p, "/des/");
  EXPECT_EQ(f.auxDirectory1, "NotOK");
  EXPECT_EQ(f.auxDirectory2, "/des/");
  EXPECT_EQ(f.auxDirectory3, "NotOK");
  EXPECT_EQ(f.auxDirectory4, "/aux/xch");
  EXPECT_EQ(f.auxDirectory5, "NotOK");
}

// The profile of each known platform is the one its end-to-end run uses;
// names that are not exactly a platform's choose none.
TEST(FocusingJob, UnknownPlatformChoosesNoProfile) {
  for (const char* unknown : {"ers", "ERS ", "SENTINEL", ""}) {
    FocuserJobFields f;
    f.platform = unknown;
    int alternating = 0;
    EXPECT_EQ(chooseParameterProfile(f, "/des/", alternating), 1) << unknown;
    EXPECT_EQ(f.processingConfFilename, "");
  }
}

// An ENVISAT product head: "PRODUCT=\"" then the product name at offset 9.
static void writeEnvisatHead(const std::string& file, const std::string& product) {
  std::string head = "PRODUCT=\"" + product;
  head.resize(200, ' ');
  writeText(file, head);
}

TEST(FocusingJob, EnvisatProfileByProductType) {
  const std::string dir = scratchDir("envisat");
  const struct {
    const char* product;
    const char* profile;
    int alternating;
  } cases[] = {{"ASA_IM__0CNPDE20120329_071134_000000163113_00121_52721_6279.N1", "parameters_ENVISAT.hdr", 0},
               {"ASA_APH_0PNPDE20040101_000000_000000162023_00001_09000_0001.N1", "parameters_AP.hdr", 1},
               {"ASA_APV_0PNPDE20040101_000000_000000162023_00001_09000_0001.N1", "parameters_AP.hdr", 1},
               {"ASA_APC_0PNPDE20040101_000000_000000162023_00001_09000_0001.N1", "parameters_AP.hdr", 1}};
  for (const auto& c : cases) {
    writeEnvisatHead(dir + "scene.N1", c.product);
    FocuserJobFields f;
    f.platform = "ENVISAT";
    f.level0Filename = dir + "scene.N1";
    int alternating = -1;
    EXPECT_EQ(chooseParameterProfile(f, "/des/", alternating), 0) << c.product;
    EXPECT_EQ(f.processingConfFilename, std::string("/des/") + c.profile);
    EXPECT_EQ(alternating, c.alternating);
  }
  for (const char* other : {"ASA_IMS_1PNPDE20040101", "ASA_APP_1PNPDE20040101", "ASA_IM__1P"}) {
    writeEnvisatHead(dir + "scene.N1", other);
    FocuserJobFields f;
    f.platform = "ENVISAT";
    f.level0Filename = dir + "scene.N1";
    int alternating = 0;
    EXPECT_EQ(chooseParameterProfile(f, "/des/", alternating), 1) << other;
  }
}
