// The job's focuser: element table, parameter documents, platform dispatch
// with the auxiliary files each sensor needs, and the temporary-file lists.
#include "focus/multiplatform_focuser.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "focus/level0_focusers.h"
#include "focus/sar_focuser.h"
#include "product/par_element.h"

namespace {

namespace fs = std::filesystem;

struct Scratch {
  fs::path dir;
  Scratch() {
    const auto* info = ::testing::UnitTest::GetInstance()->current_test_info();
    dir = fs::path(::testing::TempDir()) /
          ("tessivor_multi_" + std::to_string(getpid()) + "_" + info->name());
    fs::remove_all(dir);
    fs::create_directories(dir);
  }
  ~Scratch() {
    std::error_code ec;
    fs::remove_all(dir, ec);
  }
  std::string path(const std::string& name) const { return (dir / name).string(); }
  std::string touch(const std::string& name, const std::string& text = "x") const {
    std::ofstream(path(name), std::ios::binary) << text;
    return path(name);
  }
};

const char* const kErsProfile = TESSIVOR_SOURCE_DIR "/resources/parameters_ERS.hdr";

// An ERS job whose every file is given.
void fillErsJob(ATmultiplatformFocuser& f, const Scratch& s) {
  f.platform = "ERS";
  f.level0Filename = s.path("scene") + "/DAT_01.001";
  f.auxFile1 = s.touch("ODR.123");
  f.auxFile2 = s.touch("LEA_01.001");
  f.auxDirectory1.clear();
  f.processingConfFilename = kErsProfile;
  f.outputFilename = s.path("out");
  f.ReportFilename = "ATmultiplatformFocuser.report";
  f.skipLines = 3;
  f.extractLines = 700;
  f.Memory = 300;
}

// The MPH beginning of an ENVISAT product of the given type.
std::string envisatHead(const std::string& product) {
  return "PRODUCT=\"" + product + std::string(80, ' ');
}

}  // namespace

TEST(MultiplatformFocuser, ElementTableHasTheJobParametersInOrder) {
  ATmultiplatformFocuser f;
  const std::vector<std::string> names = {
      "Memory", "ReportFilename", "ReportLevel", "Incore", "Verbose", "processingConfFilename",
      "platform", "level0Filename", "level0FilenameSecondPol", "level0FilenameThirdPol",
      "level0FilenameFourthPol", "outputFilename", "auxFile1", "auxFile2", "auxFile3",
      "auxFile4", "auxFile5", "auxDirectory1", "auxDirectory2", "auxDirectory3",
      "auxDirectory4", "auxDirectory5", "skipLines", "extractLines", "eraseTemporaryFiles"};
  ASSERT_EQ(f.getNumberOfElements(), 25);
  for (int i = 0; i < 25; ++i) {
    EXPECT_EQ(f.getElement(i).getName(), names[i]) << i;
    EXPECT_TRUE(f.getElement(i).isMandatory()) << names[i];
    const bool integer = i == 0 || i == 2 || i == 3 || i == 4 || i >= 22;
    EXPECT_EQ(f.getElement(i).getType(), integer ? parElement::PT_INT : parElement::PT_STRING)
        << names[i];
  }
  EXPECT_EQ(f.Memory, 256);
  EXPECT_EQ(f.ReportFilename, "ATmultiplatformFocuser.report");
  EXPECT_EQ(f.ReportLevel, 1);
  EXPECT_EQ(f.Incore, 0);
  EXPECT_EQ(f.Verbose, 1);
  EXPECT_EQ(f.eraseTemporaryFiles, 0);
  EXPECT_TRUE(f.platform.empty());
  EXPECT_EQ(f.sensorFocuser(), nullptr);
}

TEST(MultiplatformFocuser, ParameterDocumentRoundTripAndRunall) {
  Scratch s;
  const std::string doc = s.path("job.xml");
  {
    ATmultiplatformFocuser f;
    f.platform = "SEASAT";
    f.level0Filename = "/data/scene";
    f.auxDirectory3 = "/aux/xca";
    f.skipLines = 12;
    f.extractLines = 3456;
    f.eraseTemporaryFiles = 1;
    f.Memory = 1024;
    ASSERT_EQ(f.writepar(doc, 2), 0);
  }
  ATmultiplatformFocuser g;
  EXPECT_EQ(g.readpar(doc, 2), 0);
  EXPECT_EQ(g.platform, "SEASAT");
  EXPECT_EQ(g.level0Filename, "/data/scene");
  EXPECT_EQ(g.auxDirectory3, "/aux/xca");
  EXPECT_EQ(g.skipLines, 12);
  EXPECT_EQ(g.extractLines, 3456);
  EXPECT_EQ(g.eraseTemporaryFiles, 1);
  EXPECT_EQ(g.Memory, 1024);
  // Another channel holds nothing: the values stay.
  ATmultiplatformFocuser h;
  h.readpar(doc, 0);
  EXPECT_TRUE(h.platform.empty());

  // The whole life from the document ends at the unknown platform.
  ATmultiplatformFocuser r;
  EXPECT_EQ(r.runall(doc, 2), 10);
  EXPECT_EQ(r.platform, "SEASAT");
  EXPECT_EQ(r.sensorFocuser(), nullptr);
}

TEST(MultiplatformFocuser, CheckparRefusesNegativeLineCounts) {
  ATmultiplatformFocuser f;
  EXPECT_EQ(f.checkpar(), 0);
  f.skipLines = -1;
  EXPECT_EQ(f.checkpar(), 1);
  f.skipLines = 0;
  f.extractLines = -5;
  EXPECT_EQ(f.checkpar(), 1);
}

TEST(MultiplatformFocuser, PlatformNamesAreExact) {
  Scratch s;
  ATmultiplatformFocuser f;
  EXPECT_EQ(f.InitProcessing(), 10);  // no platform
  for (const char* name : {"ers", "ERS ", "Envisat", "SEASAT"}) {
    fillErsJob(f, s);
    f.platform = name;
    EXPECT_EQ(f.InitProcessing(), 10) << name;
    EXPECT_EQ(f.sensorFocuser(), nullptr) << name;
  }
  // Without a report name the focuser does not start.
  fillErsJob(f, s);
  f.ReportFilename.clear();
  EXPECT_EQ(f.InitProcessing(), 1);
  // run before InitProcessing has nothing to run.
  ATmultiplatformFocuser g;
  EXPECT_NE(g.run(), 0);
}

TEST(MultiplatformFocuser, ErsFocuserReceivesSceneFilesAndProfile) {
  Scratch s;
  ATmultiplatformFocuser f;
  fillErsJob(f, s);
  ASSERT_EQ(f.InitProcessing(), 0);
  auto* ers = dynamic_cast<ersLevel0Focuser*>(f.sensorFocuser());
  ASSERT_NE(ers, nullptr);
  EXPECT_EQ(ers->level0Filename, f.level0Filename);
  EXPECT_EQ(ers->orbitFilename, s.path("ODR.123"));
  EXPECT_EQ(ers->LEAFilename, s.path("LEA_01.001"));
  EXPECT_EQ(ers->configurationFilename, kErsProfile);
  EXPECT_EQ(ers->outputFilename, s.path("out"));
  EXPECT_EQ(ers->skipLines, 3);
  EXPECT_EQ(ers->extractLines, 700);
  EXPECT_EQ(ers->Memory, 300);
  EXPECT_EQ(f.FinalizeProcessing("headerfile", 0), 0);
  EXPECT_EQ(f.sensorFocuser(), nullptr);
}

TEST(MultiplatformFocuser, ErsNeedsOrbitLeaderAndProfile) {
  Scratch s;
  ATmultiplatformFocuser f;
  // No orbit and no folder to look in.
  fillErsJob(f, s);
  f.auxFile1.clear();
  EXPECT_EQ(f.InitProcessing(), 10);
  // No leader.
  fillErsJob(f, s);
  f.auxFile2.clear();
  EXPECT_EQ(f.InitProcessing(), 10);
  // No profile: the check refuses.
  fillErsJob(f, s);
  f.processingConfFilename.clear();
  EXPECT_EQ(f.InitProcessing(), 10);
  // An orbit folder without an arc list finds nothing: the check refuses.
  fillErsJob(f, s);
  f.auxFile1.clear();
  f.auxDirectory1 = s.path("orbits");
  EXPECT_EQ(f.InitProcessing(), 10);
  EXPECT_TRUE(f.auxFile1.empty());
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
    f.auxDirectory1 = f.auxDirectory2 = f.auxDirectory3 = f.auxDirectory4 = s.dir.string();
    EXPECT_EQ(f.InitProcessing(), 10);
    f.auxDirectory1 = f.auxDirectory2 = f.auxDirectory3 = f.auxDirectory4 = "";
    *file = kept;
  }
}

TEST(MultiplatformFocuser, RadarsatNeedsOnlyTheOrbitAndPalsarIsRefused) {
  Scratch s;
  ATmultiplatformFocuser f;
  f.platform = "RADARSAT";
  f.level0Filename = s.path("dat_01.001");
  f.outputFilename = s.path("out");
  EXPECT_EQ(f.InitProcessing(), 10);
  f.auxFile1 = "orbit.txt";
  ASSERT_EQ(f.InitProcessing(), 0);
  auto* rs = dynamic_cast<radarsatLevel0Focuser*>(f.sensorFocuser());
  ASSERT_NE(rs, nullptr);
  EXPECT_EQ(rs->orbitFilename, "orbit.txt");
  EXPECT_TRUE(rs->leaderFilename.empty());

  for (const char* name : {"PALSAR", "PALSAR_ERSDAC"}) {
    ATmultiplatformFocuser p;
    p.platform = name;
    p.level0Filename = s.path("IMG-HH");
    EXPECT_EQ(p.InitProcessing(), 10) << name;
    p.auxFile1 = "orbit";
    EXPECT_EQ(p.InitProcessing(), 10) << name;
    p.auxFile2 = "LED";
    EXPECT_EQ(p.InitProcessing(), 10) << name;
    EXPECT_EQ(p.sensorFocuser(), nullptr);
  }
}

TEST(MultiplatformFocuser, ErsTemporaryFilesGoOnlyOnRequest) {
  Scratch s;
  const std::vector<std::string> chain = {"out.chirp",  "out.extracted", "out.chirp.hdr",
                                          "out.extracted.hdr", "out.rgfoc", "out.rgfoc.hdr"};
  for (const auto& name : chain) s.touch(name);
  s.touch("out");
  s.touch("out.hdr");
  ATmultiplatformFocuser f;
  fillErsJob(f, s);
  ASSERT_EQ(f.InitProcessing(), 0);
  EXPECT_EQ(f.FinalizeProcessing("headerfile", 0), 0);
  for (const auto& name : chain) EXPECT_TRUE(fs::exists(s.path(name))) << name;
  EXPECT_EQ(f.sensorFocuser(), nullptr);

  f.eraseTemporaryFiles = 1;
  ASSERT_EQ(f.InitProcessing(), 0);
  EXPECT_EQ(f.FinalizeProcessing("headerfile", 0), 0);
  for (const auto& name : chain) EXPECT_FALSE(fs::exists(s.path(name))) << name;
  EXPECT_TRUE(fs::exists(s.path("out")));
  EXPECT_TRUE(fs::exists(s.path("out.hdr")));
  // Files that never existed cost a warning, not a failure.
  EXPECT_EQ(f.FinalizeProcessing("headerfile", 0), 0);
  // An unknown platform cannot choose a list.
  f.platform = "SEASAT";
  EXPECT_EQ(f.FinalizeProcessing("headerfile", 0), 10);
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

TEST(ErsProfile, ChainReadsTheErsValues) {
  SARFocuser_conf conf;
  ASSERT_EQ(conf.readpar(kErsProfile), 0);
  EXPECT_EQ(conf.Memory, 512);
  EXPECT_EQ(conf.Verbose, 1);
  EXPECT_EQ(conf.DeleteTempFiles, 0);
  ASSERT_EQ(conf.readconf(kErsProfile), 0);
  // Doppler bins: the contrast cells divide them.
  EXPECT_EQ(conf.Blocks, 256);
  EXPECT_EQ(conf.Blockl, 1024);
  EXPECT_EQ(conf.Blocks % conf.Patchs, 0);
  EXPECT_EQ(conf.Blockl % conf.Patchl, 0);
  EXPECT_DOUBLE_EQ(conf.RgBand, 0.82);
  // Ambiguity from the data, WDAR over every low-contrast block.
  EXPECT_EQ(conf.Amb_flag, 1);
  EXPECT_EQ(conf.Nwdarblocks, 200);
  const int weights[7] = {1, 1, 1, 0, 0, 0, 0};
  for (int i = 0; i < 7; ++i) EXPECT_EQ(conf.Pol_Weights[i], weights[i]) << i;
  // Azimuth blocks: overlaps are kept halved.
  EXPECT_EQ(conf.LinesInBlock, 8192);
  EXPECT_EQ(conf.AzimuthOverlap, 1280);
  EXPECT_EQ(conf.SamplesInBlock, 1024);
  EXPECT_EQ(conf.RangeOverlap, 32);
  EXPECT_EQ(conf.PerformInterpolation, 7);
  EXPECT_DOUBLE_EQ(conf.AzimuthWindowHammingParameter, 0.75);
  EXPECT_DOUBLE_EQ(conf.AzimuthLookBandwidth, 0.8);
  EXPECT_DOUBLE_EQ(conf.ApplyAzShift, 1.0);
  EXPECT_EQ(conf.WhiteningFlag, 1);
  EXPECT_DOUBLE_EQ(conf.AntennaLength, 9.45);
  EXPECT_EQ(conf.Flag_rangefoc, 1);
  EXPECT_EQ(conf.Flag_dcest, 1);
  EXPECT_EQ(conf.Flag_azimuthfoc, 1);
  EXPECT_EQ(conf.Multilook, 0);

  // The overlap holds the processed aperture plus the beam walk of a
  // centroid of half a PRF, at the lowest ERS Doppler rate.
  const double prf = 1679.9, rate = 2000.0;
  const double aperture = conf.AzimuthLookBandwidth * prf / rate * prf;
  const double walk = 0.5 * prf / rate * prf;
  EXPECT_GE(2 * conf.AzimuthOverlap, aperture + 2 * walk);
  EXPECT_GT(conf.LinesInBlock, 2 * (2 * conf.AzimuthOverlap));
}

TEST(MultiplatformFocuser, PalsarSceneCountMustFitThePolarisationsOfTheProduct) {
  Scratch s;
  // JAXA leaders: the polarisation count at offset 1108.
  auto leader = [&s](const std::string& name, const char* count) {
    std::string bytes(2700, ' ');
    bytes.replace(1108, 4, count);
    return s.touch(name, bytes);
  };
  ATmultiplatformFocuser f;
  f.platform = "PALSAR";
  f.level0Filename = s.touch("IMG-HH", std::string(800, '\0'));
  f.auxFile1 = "orbit";
  EXPECT_EQ(f.palsarSceneCount(), 1);
  f.level0FilenameSecondPol = "IMG-HV";
  EXPECT_EQ(f.palsarSceneCount(), 2);
  f.level0FilenameFourthPol = "IMG-VV";
  EXPECT_EQ(f.palsarSceneCount(), 4);

  EXPECT_EQ(f.checkMultiPolPalsar(2), 10);  // no leader
  f.auxFile2 = leader("LED-single", "   1");
  EXPECT_EQ(f.checkMultiPolPalsar(1), 0);
  EXPECT_EQ(f.checkMultiPolPalsar(2), 10);
  f.auxFile2 = leader("LED-double", "   2");
  EXPECT_EQ(f.checkMultiPolPalsar(2), 0);
  EXPECT_EQ(f.checkMultiPolPalsar(3), 10);
  f.auxFile2 = leader("LED-quad", "   4");
  EXPECT_EQ(f.checkMultiPolPalsar(4), 0);
}
