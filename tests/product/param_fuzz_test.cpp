// Malformed, binary, truncated and oversized inputs given to the profile
// reader and to the XML parameter documents: no crash, no hang, sane
// results, and files written afterwards that read back.
#include <gtest/gtest.h>

#include "support/files.h"
#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <random>
#include <sstream>
#include <string>
#include <vector>

#include "product/general_sar_base.h"
#include "product/orvane_xml.h"
#include "product/profile.h"

namespace {

namespace fs = std::filesystem;

class FuzzTool : public GeneralSAR_Base {
 public:
  FuzzTool() { createElementsVector(6); }
  int createBuffers() override {
    if (isBufferAllocated()) destroyBuffers();
    Table.assign(size_t(std::clamp(nTable, 0, 64)), 0.0f);
    refreshParameters();
    setAllocationFlag(true);
    return 0;
  }
  int destroyBuffers() override {
    Table.clear();
    setAllocationFlag(false);
    return 0;
  }
  void refreshParameters() override {
    addElementInt("Count", &Count, 1, 0, 10, false);
    addElementDouble("Coeffs", Coeffs, 4, 0, 0, false);
    addElementString("Name", &Name, false);
    addElementString("Pair", Pair, 2, false);
    addElementInt("nTable", &nTable, 1, 0, 64, false);
    addElementFloat("Table", Table.data(), int(Table.size()), 0, 0, false);
    setAllocationFlag(true);
  }
  int Count = 0;
  double Coeffs[4] = {0, 0, 0, 0};
  std::string Name;
  std::string Pair[2];
  int nTable = 0;
  std::vector<float> Table;
};

class ParamFuzzTest : public support::ScratchFolderTest {
 protected:
  void SetUp() override { FreeProfile(); }
  void TearDown() override { FreeProfile(); }
};

std::string randomText(std::mt19937& rng, size_t maxLen, bool syntaxHeavy) {
  static const std::string alphabet = "[]= \n\t{}\"ab1.-,;\r";
  std::uniform_int_distribution<size_t> len(0, maxLen);
  std::uniform_int_distribution<int> byte(0, 255);
  std::uniform_int_distribution<size_t> pick(0, alphabet.size() - 1);
  std::string s(len(rng), '\0');
  for (char& c : s) c = syntaxHeavy ? alphabet[pick(rng)] : char(byte(rng));
  return s;
}


TEST_F(ParamFuzzTest, ProfileVeryLongLines) {
  const std::string huge(3 << 20, 'k');
  // A key that never meets '=', a section name that never meets ']', and a
  // value of megabytes.
  const std::string f1 = make("k.hdr", "[S]\n" + huge);
  const std::string f2 = make("s.hdr", "[" + huge);
  const std::string f3 = make("v.hdr", "[S]\nk = " + huge + "\nj = 1");
  const std::string f4 = make("n.hdr", std::string(1 << 20, '\n') + "[S]\nk = 1");
  std::string v;
  EXPECT_EQ(GetMyProfileString("S", "k", v, f1), 10);
  EXPECT_EQ(GetMyProfileString("S", "k", v, f2), 10);
  EXPECT_EQ(GetMyProfileString("S", "k", v, f3), 0);
  EXPECT_EQ(v, huge);
  EXPECT_EQ(GetMyProfileString("S", "j", v, f3), 0);
  EXPECT_EQ(v, "1");
  EXPECT_EQ(GetMyProfileString("S", "k", v, f4), 0);
  EXPECT_EQ(v, "1");
  int n = 0;
  EXPECT_EQ(GetMyProfileIntArray("S", "k", &n, 1, f3), 10);
  // A number array of a megabyte of digits in one token.
  const std::string f5 = make("d.hdr", "[S]\nk = {" + std::string(1 << 20, '9') + " 1}\n");
  double d[2] = {0, 0};
  EXPECT_EQ(GetProfileDoubleArray("S", "k", d, 2, f5), 0);
  EXPECT_EQ(d[1], 1.0);
}

const char* const kValidDoc =
    "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
    "<OrvaneXmlDoc>\n"
    "  <NumberOfChannels>1</NumberOfChannels>\n"
    "  <Description>My description</Description>\n"
    "  <Channel Number=\"1\">\n"
    "    <FuzzTool>\n"
    "      <Count>3</Count>\n"
    "      <Coeffs>\n"
    "        <val N=\"1\">1</val>\n"
    "        <val N=\"2\">2</val>\n"
    "        <val N=\"3\">3</val>\n"
    "        <val N=\"4\">4</val>\n"
    "      </Coeffs>\n"
    "      <Name>n &amp; m</Name>\n"
    "      <Pair N=\"1\">p</Pair>\n"
    "      <Pair N=\"2\">q</Pair>\n"
    "      <nTable>2</nTable>\n"
    "      <Table>0.5, 0.25</Table>\n"
    "    </FuzzTool>\n"
    "  </Channel>\n"
    "</OrvaneXmlDoc>\n";

// Reads with the tool and a bare document object, then writes the tool's
// block: the result must be a well-formed parameter document.
void readThenWrite(const std::string& f, bool checkWritten) {
  FuzzTool t;
  t.readAuxiliaryFile(f, 1, "FuzzTool");
  std::string conf;
  t.getConfigurationFile(f, 1, "FuzzTool", conf);
  orvanexml doc(f);
  double d[4];
  int i[2];
  float fl[2];
  std::string s[2];
  doc.readDouble(1, "FuzzTool/Coeffs", d, 4);
  doc.readInt(1, "FuzzTool/Count", i, 2);
  doc.readFloat(1, "FuzzTool/Table", fl, 2);
  doc.readString(1, "FuzzTool/Pair", s, 2);
  doc.countNodes(1, "FuzzTool");
  if (!checkWritten) return;
  t.createBuffers();
  ASSERT_EQ(t.writeAuxiliaryFile(f, 1, "FuzzTool"), 0) << f;
  orvanexml back(f);
  EXPECT_TRUE(back.isRecognised()) << f;
  FuzzTool r;
  EXPECT_TRUE(r.readAuxiliaryFile(f, 1, "FuzzTool")) << f;
  EXPECT_EQ(r.Count, t.Count);
  EXPECT_EQ(r.Name, t.Name);
  EXPECT_EQ(r.Table, t.Table);
}

TEST_F(ParamFuzzTest, XmlTruncatedAndMutatedDocuments) {
  const std::string valid = kValidDoc;
  for (size_t cut = 0; cut < valid.size(); cut += 7)
    readThenWrite(make("cut.xml", valid.substr(0, cut)), cut % 49 == 0);
  std::mt19937 rng(7u);
  std::uniform_int_distribution<size_t> where(0, valid.size() - 1);
  std::uniform_int_distribution<int> byte(0, 255);
  for (int round = 0; round < 150; ++round) {
    std::string m = valid;
    for (int k = 0; k < 1 + round % 4; ++k) m[where(rng)] = char(byte(rng));
    readThenWrite(make("mut.xml", m), round % 10 == 0);
  }
}

TEST_F(ParamFuzzTest, XmlRandomBytesDeepNestingAndLongText) {
  std::mt19937 rng(99u);
  for (int round = 0; round < 60; ++round)
    readThenWrite(make("rnd.xml", randomText(rng, 3000, false)), round % 20 == 0);
  std::string deep = "<OrvaneXmlDoc><NumberOfChannels>1</NumberOfChannels>"
                     "<Description/><Channel Number=\"1\"><FuzzTool>";
  for (int i = 0; i < 20000; ++i) deep += "<a>";
  readThenWrite(make("deep.xml", deep), true);
  const std::string longText = "<OrvaneXmlDoc><NumberOfChannels>1</NumberOfChannels>"
                               "<Description>" + std::string(2 << 20, 'd') +
                               "</Description><Channel Number=\"1\"><FuzzTool><Coeffs>" +
                               std::string(1 << 20, '1') + ", 2, 3, 4</Coeffs><Name>" +
                               std::string(1 << 20, 'n') + "</Name></FuzzTool></Channel>"
                               "</OrvaneXmlDoc>";
  const std::string f = make("long.xml", longText);
  FuzzTool t;
  EXPECT_TRUE(t.readAuxiliaryFile(f, 1, "FuzzTool"));
  EXPECT_EQ(t.Name.size(), size_t(1 << 20));
  EXPECT_EQ(t.Coeffs[3], 4.0);
  // Flat legacy text that is not a list of numbers.
  for (const char* flat : {"", ",", ", , ,", "1,", "1, 2, 3, 4, 5, 6", "x, 1, 2, 3", "1e999, -1e999, nan, inf"}) {
    const std::string g = make("flat.xml",
                               "<OrvaneXmlDoc><NumberOfChannels>1</NumberOfChannels>"
                               "<Description/><Channel Number=\"1\"><FuzzTool><Coeffs>" +
                                   std::string(flat) +
                                   "</Coeffs></FuzzTool></Channel></OrvaneXmlDoc>");
    FuzzTool u;
    u.readAuxiliaryFile(g, 1, "FuzzTool");
  }
}

}  // namespace
