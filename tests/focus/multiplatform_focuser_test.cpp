// The job's focuser: element table, parameter documents, platform dispatch
// with the auxiliary files each sensor needs, and the temporary-file lists.
#include "focus/multiplatform_focuser.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <string>
#include <vector>

#include "focus/sensors/envisat.h"
#include "focus/sensors/ers.h"
#include "support/files.h"

namespace {

namespace fs = std::filesystem;

// A scratch folder with small files made on request.
struct Scratch : support::TempFolder {
  Scratch() : TempFolder("multi") {}
  std::string path(const std::string& name) const { return *this / name; }
  std::string touch(const std::string& name, const std::string& text = "x") const {
    support::writeText(path(name), text);
    return path(name);
  }
};

const char* const kErsProfile = TESSIVOR_SOURCE_DIR "/resources/parameters_ERS.hdr";

// The MPH beginning of an ENVISAT product of the given type.
std::string envisatHead(const std::string& product) {
  return "PRODUCT=\"" + product + std::string(80, ' ');
}

}  // namespace

TEST(MultiplatformFocuser, CheckparRefusesNegativeLineCounts) {
  ATmultiplatformFocuser f;
  EXPECT_EQ(f.checkpar(), 0);
  f.skipLines = -1;
  EXPECT_EQ(f.checkpar(), 1);
  f.skipLines = 0;
  f.extractLines = -5;
  EXPECT_EQ(f.checkpar(), 1);
}

TEST(MultiplatformFocuser, EnvisatFillsFourAuxiliaryFiles) {
  Scratch s;
  ATmultiplatformFocuser f;
  f.platform = "ENVISAT";
  f.level0Filename = s.touch("ASA_IM__0P.N1", envisatHead("ASA_IM__0PNPDE"));
  f.processingConfFilename = kErsProfile;
  f.outputFilename = s.path("out");
  f.auxFile1 = "dor";
  f.auxFile2 = "ins";
  f.auxFile3 = "xca";
  f.auxFile4 = "xch";
  ASSERT_EQ(f.InitProcessing(), 0);
  auto* env = dynamic_cast<envisatLevel0Focuser*>(f.sensorFocuser());
  ASSERT_NE(env, nullptr);
  EXPECT_EQ(env->orbitFilename, "dor");
  EXPECT_EQ(env->ASA_INSFilename, "ins");
  EXPECT_EQ(env->ASA_XCAFilename, "xca");
  EXPECT_EQ(env->ASA_XCHFilename, "xch");
  EXPECT_EQ(env->configurationFilename, kErsProfile);

  // Each file missing without a folder is refused; with a folder that
  // holds nothing valid the check refuses.
  for (std::string* file : {&f.auxFile1, &f.auxFile2, &f.auxFile3, &f.auxFile4}) {
    const std::string kept = *file;
    file->clear();
    EXPECT_EQ(f.InitProcessing(), 10);
    f.auxDirectory1 = f.auxDirectory2 = f.auxDirectory3 = f.auxDirectory4 = s.str();
    EXPECT_EQ(f.InitProcessing(), 10);
    f.auxDirectory1 = f.auxDirectory2 = f.auxDirectory3 = f.auxDirectory4 = "";
    *file = kept;
  }
}

TEST(MultiplatformFocuser, EnvisatAlternatingProductsEraseBothChannels) {
  Scratch s;
  const std::vector<std::string> common = {"out.chirp", "out.extracted", "out.chirp.hdr",
                                           "out.extracted.hdr", "out.rgfoc", "out.rgfoc.hdr",
                                           "out.antenna", "out.antenna.hdr"};
  std::vector<std::string> channels;
  for (const std::string n : {"1", "2"})
    for (const std::string& name :
         {".chirp" + n + ".hdr", ".chirp" + n, ".extracted" + n, ".extracted" + n + ".hdr",
          ".antenna" + n, ".antenna" + n + ".hdr", n + ".rgfoc", n + ".rgfoc.hdr"})
      channels.push_back("out" + name);
  ATmultiplatformFocuser f;
  f.platform = "ENVISAT";
  f.outputFilename = s.path("out");
  f.eraseTemporaryFiles = 1;

  // Image mode: the channel files are not touched.
  f.level0Filename = s.touch("im.N1", envisatHead("ASA_IM__0PNPDE"));
  for (const auto& n : common) s.touch(n);
  for (const auto& n : channels) s.touch(n);
  EXPECT_EQ(f.FinalizeProcessing("headerfile", 0), 0);
  for (const auto& n : common) EXPECT_FALSE(fs::exists(s.path(n))) << n;
  for (const auto& n : channels) EXPECT_TRUE(fs::exists(s.path(n))) << n;

  // Alternating polarisation: both channels go too.
  f.level0Filename = s.touch("ap.N1", envisatHead("ASA_APH_0PNPDE"));
  for (const auto& n : common) s.touch(n);
  EXPECT_EQ(f.FinalizeProcessing("headerfile", 0), 0);
  for (const auto& n : common) EXPECT_FALSE(fs::exists(s.path(n))) << n;
  for (const auto& n : channels) EXPECT_FALSE(fs::exists(s.path(n))) << n;
}

TEST(MultiplatformFocuser, PalsarListsCarryThePolarisationLabel) {
  Scratch s;
  // Image files whose transmit and receive codes sit at bytes 773 and 775.
  auto image = [&s](const std::string& name, char tx, char rx) {
    std::string bytes(800, '\0');
    bytes[773] = tx;
    bytes[775] = rx;
    return s.touch(name, bytes);
  };
  ATmultiplatformFocuser f;
  f.platform = "PALSAR";
  f.outputFilename = s.path("out");
  f.eraseTemporaryFiles = 1;
  f.level0Filename = image("IMG-HV", 0, 1);
  const std::vector<std::string> single = {
      "out.chirp", "out.extracted_hv", "out.extracted_hv.interf", "out.chirp.hdr",
      "out.extracted_hv.hdr", "out.extracted_hv.interf.hdr", "out.rgfoc", "out.rgfoc.hdr"};
  for (const auto& n : single) s.touch(n);
  EXPECT_EQ(f.FinalizeProcessing("headerfile", 0), 0);
  for (const auto& n : single) EXPECT_FALSE(fs::exists(s.path(n))) << n;

  // Several scenes: one set for each, named by its label; an unknown code
  // pair gives the label "4".
  f.platform = "PALSAR_ERSDAC";
  f.level0Filename = image("IMG-HH", 0, 0);
  f.level0FilenameSecondPol = image("IMG-VV", 1, 1);
  f.level0FilenameThirdPol = image("IMG-XX", 2, 7);
  std::vector<std::string> multi;
  for (const char* label : {"hh", "vv", "4"})
    for (const char* suffix : {".chirp", ".extracted", ".extracted.interf", ".chirp.hdr",
                               ".extracted.hdr", ".extracted.interf.hdr", ".rgfoc",
                               ".rgfoc.hdr"})
      multi.push_back(std::string("out_") + label + suffix);
  for (const auto& n : multi) s.touch(n);
  EXPECT_EQ(f.FinalizeProcessing("headerfile", 0), 0);
  for (const auto& n : multi) EXPECT_FALSE(fs::exists(s.path(n))) << n;
}

TEST(MultiplatformFocuser, SceneDirectoryIsCutAtTheLastSeparator) {
  EXPECT_EQ(scenePathDirectory("/data/ERS2_SIM/DAT_01.001"), "/data/ERS2_SIM");
  EXPECT_EQ(scenePathDirectory("C:\\data\\scene\\DAT_01.001"), "C:\\data\\scene");
  EXPECT_EQ(scenePathDirectory("/data/mixed\\DAT_01.001"), "/data/mixed");
  EXPECT_EQ(scenePathDirectory("DAT_01.001"), "");
  EXPECT_EQ(scenePathDirectory("/DAT"), "");
}
