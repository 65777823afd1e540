// Parameter base classes: element tables, the three-stage read, block
// replacement on write, channels, and the tool-class pattern.
#include "product/general_sar_base.h"

#include <gtest/gtest.h>

#include "support/files.h"
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;

// A tool written the way every tool of the suite is written.
class ATSample : public GeneralSAR_Base {
 public:
  ATSample() { createElementsVector(8); }
  ~ATSample() override { destroyBuffers(); }

  int createBuffers() override {
    if (isBufferAllocated()) destroyBuffers();
    Samples.assign(size_t(std::max(nSamples, 0)), 0.0);
    refreshParameters();
    setAllocationFlag(true);
    ++createCalls;
    return 0;
  }
  int destroyBuffers() override {
    Samples.clear();
    setAllocationFlag(false);
    return 0;
  }
  void refreshParameters() override {
    addElementInt("Memory", &Memory, 1, 0, 2147483647, true);
    addElementString("ReportFilename", &ReportFilename, true);
    addElementFloat("Gain", &Gain, 1, 0.0f, 10.0f, false);
    addElementDouble("Coeffs", Coeffs, 3, -1e9, 1e9, false);
    addElementString("Names", Names, 2, false);
    addElementInt("nSamples", &nSamples, 1, 0, 1000, false);
    addElementDouble("Samples", Samples.data(), int(Samples.size()), 0.0, 0.0, false);
    addElementInt("Unused", &Unused, 0, 0, 1, false);
    setAllocationFlag(true);
  }
  int readpar(const std::string& file, int channel) {
    readAuxiliaryFile(file, channel, "ATSample");
    return 0;
  }
  int writepar(const std::string& file, int channel) {
    return writeAuxiliaryFile(file, channel, "ATSample");
  }
  int checkpar() {
    checkAuxiliaryFile();
    return 0;
  }

  int Memory = 256;
  std::string ReportFilename = "ATSample.report";
  float Gain = 1.0f;
  double Coeffs[3] = {0.0, 0.0, 0.0};
  std::string Names[2];
  int nSamples = 0;
  std::vector<double> Samples;
  int Unused = 0;
  int createCalls = 0;
};

class ATOther : public GeneralSAR_Base {
 public:
  ATOther() { createElementsVector(1); }
  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override {
    setAllocationFlag(false);
    return 0;
  }
  void refreshParameters() override {
    addElementInt("Level", &Level, 1, 0, 3, true);
    setAllocationFlag(true);
  }
  int Level = 2;
};

using GeneralSarBaseTest = support::ScratchFolderTest;

bool xmllintAccepts(const std::string& file) {
  if (std::system("command -v xmllint >/dev/null 2>&1") != 0) return true;  // not installed
  const std::string cmd = "xmllint --noout '" + file + "' >/dev/null 2>&1";
  return std::system(cmd.c_str()) == 0;
}

TEST_F(GeneralSarBaseTest, WriteparReplacesItsBlockAndKeepsTheOthers) {
  const std::string f = path("par.xml");
  ATSample t;
  t.Memory = 512;
  t.ReportFilename = "run.report";
  t.Gain = 0.5f;
  t.Coeffs[0] = 1.0;
  t.Coeffs[1] = 0.1;
  t.Coeffs[2] = -3e-7;
  t.Names[0] = "HH";
  t.Names[1] = "VV";
  t.nSamples = 2;
  t.createBuffers();  // allocates Samples and re-aims the table at it
  t.Samples[0] = 4.5;
  t.Samples[1] = 5.5;
  ASSERT_EQ(t.writepar(f, 3), 0);
  ATOther o;
  ASSERT_EQ(o.writeAuxiliaryFile(f, 3, "ATOther"), 0);
  ASSERT_EQ(t.writepar(f, 1), 0);
  // The second write of ATSample in channel 3 replaces its block, which then
  // follows the ATOther block.
  t.Memory = 1024;
  t.nSamples = 0;
  t.createBuffers();
  ASSERT_EQ(t.writepar(f, 3), 0);
  EXPECT_EQ(t.getAuxiliaryFileName(), "");
  EXPECT_EQ(t.getAuxiliaryChannel(), 0);
  EXPECT_EQ(slurp(f),
            "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
            "<OrvaneXmlDoc>\n"
            "  <NumberOfChannels>2</NumberOfChannels>\n"
            "  <Description>My description</Description>\n"
            "  <Channel Number=\"3\">\n"
            "    <ATOther>\n"
            "      <Level>2</Level>\n"
            "    </ATOther>\n"
            "    <ATSample>\n"
            "      <Memory>1024</Memory>\n"
            "      <ReportFilename>run.report</ReportFilename>\n"
            "      <Gain>0.5</Gain>\n"
            "      <Coeffs>\n"
            "        <val N=\"1\">1</val>\n"
            "        <val N=\"2\">0.1</val>\n"
            "        <val N=\"3\">-3e-07</val>\n"
            "      </Coeffs>\n"
            "      <Names N=\"1\">HH</Names>\n"
            "      <Names N=\"2\">VV</Names>\n"
            "      <nSamples>0</nSamples>\n"
            "    </ATSample>\n"
            "  </Channel>\n"
            "  <Channel Number=\"1\">\n"
            "    <ATSample>\n"
            "      <Memory>512</Memory>\n"
            "      <ReportFilename>run.report</ReportFilename>\n"
            "      <Gain>0.5</Gain>\n"
            "      <Coeffs>\n"
            "        <val N=\"1\">1</val>\n"
            "        <val N=\"2\">0.1</val>\n"
            "        <val N=\"3\">-3e-07</val>\n"
            "      </Coeffs>\n"
            "      <Names N=\"1\">HH</Names>\n"
            "      <Names N=\"2\">VV</Names>\n"
            "      <nSamples>2</nSamples>\n"
            "      <Samples>\n"
            "        <val N=\"1\">4.5</val>\n"
            "        <val N=\"2\">5.5</val>\n"
            "      </Samples>\n"
            "    </ATSample>\n"
            "  </Channel>\n"
            "</OrvaneXmlDoc>\n");
  EXPECT_TRUE(xmllintAccepts(f));

  // Three-stage read: nSamples first, then the buffer, then the array.
  ATSample r;
  const int before = r.createCalls;
  EXPECT_TRUE(r.readAuxiliaryFile(f, 1, "ATSample"));
  EXPECT_EQ(r.createCalls, before + 1);
  EXPECT_EQ(r.Memory, 512);
  EXPECT_EQ(r.ReportFilename, "run.report");
  EXPECT_EQ(r.Gain, 0.5f);
  EXPECT_EQ(r.Coeffs[1], 0.1);
  EXPECT_EQ(r.Coeffs[2], -3e-7);
  EXPECT_EQ(r.Names[1], "VV");
  EXPECT_EQ(r.Samples, (std::vector<double>{4.5, 5.5}));
  ATOther o2;
  o2.Level = 0;
  EXPECT_TRUE(o2.readAuxiliaryFile(f, 3, "ATOther"));
  EXPECT_EQ(o2.Level, 2);
}

TEST_F(GeneralSarBaseTest, ReadFailuresAndDefaults) {
  const std::string f = make("partial.xml",
                             "<OrvaneXmlDoc><NumberOfChannels>2</NumberOfChannels>"
                             "<Description>x</Description>"
                             "<Channel Number=\"1\"><ATSample>"
                             "<Memory>100</Memory><ReportFilename>r</ReportFilename>"
                             "<Coeffs>1, 2, 3</Coeffs><Unused>1</Unused>"
                             "<ConfigurationFile>conf.xml</ConfigurationFile>"
                             "</ATSample></Channel>"
                             "<Channel Number=\"2\"><ATSample>"
                             "<Gain>9</Gain><ReportFilename>r2</ReportFilename>"
                             "</ATSample></Channel></OrvaneXmlDoc>");
  // Optional elements missing: defaults stay; the legacy flat form is read;
  // an element of size 0 is not read.
  ATSample a;
  EXPECT_TRUE(a.readAuxiliaryFile(f, 1, "ATSample"));
  EXPECT_EQ(a.Memory, 100);
  EXPECT_EQ(a.Gain, 1.0f);
  EXPECT_EQ(a.Coeffs[0], 1.0);
  EXPECT_EQ(a.Coeffs[2], 3.0);
  EXPECT_EQ(a.Names[0], "");
  EXPECT_EQ(a.Unused, 0);
  EXPECT_TRUE(a.Samples.empty());

  // A mandatory element missing ends the read early; readpar still returns 0.
  ATSample b;
  EXPECT_FALSE(b.readAuxiliaryFile(f, 2, "ATSample"));
  EXPECT_EQ(b.Gain, 1.0f);  // stage 1 stopped at Memory
  EXPECT_EQ(b.ReportFilename, "ATSample.report");
  EXPECT_EQ(b.readpar(f, 2), 0);
  EXPECT_EQ(b.checkpar(), 0);

  // Missing channel, missing class, foreign file, absent file.
  EXPECT_FALSE(b.readAuxiliaryFile(f, 7, "ATSample"));
  EXPECT_FALSE(b.readAuxiliaryFile(f, 1, "Nothing"));
  EXPECT_FALSE(b.readAuxiliaryFile(make("junk.xml", "\x01\x02garbage"), 1, "ATSample"));
  EXPECT_FALSE(b.readAuxiliaryFile(path("absent.xml"), 1, "ATSample"));
  EXPECT_FALSE(fs::exists(path("absent.xml")));

  std::string conf = "unchanged";
  EXPECT_TRUE(a.getConfigurationFile(f, 1, "ATSample", conf));
  EXPECT_EQ(conf, "conf.xml");
  EXPECT_FALSE(a.getConfigurationFile(f, 2, "ATSample", conf));
  EXPECT_FALSE(a.getConfigurationFile(path("absent.xml"), 1, "ATSample", conf));
  EXPECT_EQ(conf, "conf.xml");
}

}  // namespace
