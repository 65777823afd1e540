// XML parameter documents: layout, channels, arrays, legacy flat form,
// replacement of foreign files, and acceptance by xmllint.
#include "product/orvane_xml.h"

#include <gtest/gtest.h>

#include "support/files.h"
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>

namespace {

namespace fs = std::filesystem;

using OrvaneXmlTest = support::ScratchFolderTest;

bool haveXmllint() { return std::system("command -v xmllint >/dev/null 2>&1") == 0; }

// xmllint's verdict on a file: true when it parses as well-formed XML.
bool xmllintAccepts(const std::string& file) {
  const std::string cmd = "xmllint --noout '" + file + "' >/dev/null 2>&1";
  return std::system(cmd.c_str()) == 0;
}

TEST_F(OrvaneXmlTest, NewDocumentLayoutAndChannels) {
  const std::string f = path("doc.xml");
  orvanexml doc(f);
  EXPECT_TRUE(doc.isOpen());
  EXPECT_FALSE(doc.isRecognised());
  EXPECT_EQ(doc.getNumberOfChannels(), 0);
  EXPECT_EQ(doc.getDescription(), "My description");
  EXPECT_FALSE(fs::exists(f));  // nothing is saved without write()

  // Channel 3 into an empty document: one channel, numbered 3.
  const int memory = 256;
  const double coeffs[] = {1.5, -0.25, 6378137.0};
  const float gain = 0.1f;
  const std::string names[] = {"first", "a & b <c>"};
  ASSERT_EQ(doc.writeInt(3, "Tool/Memory", &memory, 1), 0);
  ASSERT_EQ(doc.writeDouble(3, "Tool/Coeffs", coeffs, 3), 0);
  ASSERT_EQ(doc.writeFloat(3, "Tool/Gain", &gain, 1), 0);
  ASSERT_EQ(doc.writeString(3, "Tool/Name", names, 1), 0);
  ASSERT_EQ(doc.writeString(1, "Other/Names", names, 2), 0);
  EXPECT_EQ(doc.getNumberOfChannels(), 2);
  ASSERT_EQ(doc.write(), 0);
  EXPECT_EQ(slurp(f),
            "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
            "<OrvaneXmlDoc>\n"
            "  <NumberOfChannels>2</NumberOfChannels>\n"
            "  <Description>My description</Description>\n"
            "  <Channel Number=\"3\">\n"
            "    <Tool>\n"
            "      <Memory>256</Memory>\n"
            "      <Coeffs>\n"
            "        <val N=\"1\">1.5</val>\n"
            "        <val N=\"2\">-0.25</val>\n"
            "        <val N=\"3\">6378137</val>\n"
            "      </Coeffs>\n"
            "      <Gain>0.100000001490116</Gain>\n"
            "      <Name>first</Name>\n"
            "    </Tool>\n"
            "  </Channel>\n"
            "  <Channel Number=\"1\">\n"
            "    <Other>\n"
            "      <Names N=\"1\">first</Names>\n"
            "      <Names N=\"2\">a &amp; b &lt;c&gt;</Names>\n"
            "    </Other>\n"
            "  </Channel>\n"
            "</OrvaneXmlDoc>\n");
  if (haveXmllint()) {
    EXPECT_TRUE(xmllintAccepts(f));
  }

  // Read back through a fresh object.
  orvanexml again(f);
  EXPECT_TRUE(again.isRecognised());
  EXPECT_EQ(again.getNumberOfChannels(), 2);
  int m = 0;
  double c[3] = {0, 0, 0};
  float g = 0;
  std::string s[2];
  EXPECT_EQ(again.readInt(3, "Tool/Memory", &m, 1), 0);
  EXPECT_EQ(m, 256);
  EXPECT_EQ(again.readDouble(3, "Tool/Coeffs", c, 3), 0);
  EXPECT_EQ(c[0], 1.5);
  EXPECT_EQ(c[1], -0.25);
  EXPECT_EQ(c[2], 6378137.0);
  EXPECT_EQ(again.readFloat(3, "Tool/Gain", &g, 1), 0);
  EXPECT_EQ(g, 0.1f);
  EXPECT_EQ(again.readString(1, "Other/Names", s, 2), 0);
  EXPECT_EQ(s[1], "a & b <c>");
  // Wrong channel, missing element, too few strings: 1, targets untouched.
  m = -7;
  EXPECT_EQ(again.readInt(1, "Tool/Memory", &m, 1), 1);
  EXPECT_EQ(again.readInt(3, "Tool/Nothing", &m, 1), 1);
  EXPECT_EQ(m, -7);
  EXPECT_EQ(again.readString(3, "Tool/Name", s, 2), 1);
  EXPECT_EQ(again.countNodes(1, "Other/Names"), 2);
  EXPECT_EQ(again.removeNodes(1, "Other"), 1);
  EXPECT_EQ(again.countNodes(1, "Other/Names"), 0);
}

TEST_F(OrvaneXmlTest, LegacyFlatFormAndTooFewItems) {
  const std::string f = make("legacy.xml",
                             "<?xml version=\"1.0\"?>\n"
                             "<OrvaneXmlDoc><NumberOfChannels>1</NumberOfChannels>"
                             "<Description>old</Description>"
                             "<Channel Number=\"1\"><Tool>"
                             "<D>1.5, -2, 3e2</D><I>4, 5, 6</I><F>0.5, 0.25</F>"
                             "<Short>1, 2</Short><Bad>1, x, 3</Bad>"
                             "<Two><val N=\"1\">7</val></Two>"
                             "</Tool></Channel></OrvaneXmlDoc>\n");
  orvanexml doc(f);
  ASSERT_TRUE(doc.isRecognised());
  EXPECT_EQ(doc.getDescription(), "old");
  double d[3] = {0, 0, 0};
  EXPECT_EQ(doc.readDouble(1, "Tool/D", d, 3), 0);
  EXPECT_EQ(d[0], 1.5);
  EXPECT_EQ(d[1], -2.0);
  EXPECT_EQ(d[2], 300.0);
  int i[3] = {0, 0, 0};
  EXPECT_EQ(doc.readInt(1, "Tool/I", i, 3), 0);
  EXPECT_EQ(i[2], 6);
  float fl[2] = {0, 0};
  EXPECT_EQ(doc.readFloat(1, "Tool/F", fl, 2), 0);
  EXPECT_EQ(fl[1], 0.25f);
  EXPECT_EQ(doc.readInt(1, "Tool/Short", i, 3), 1);
  EXPECT_EQ(doc.readInt(1, "Tool/Bad", i, 3), 1);
  EXPECT_EQ(doc.readInt(1, "Tool/Two", i, 2), 1);  // one val for two items
  EXPECT_EQ(i[0], 7);
}

TEST_F(OrvaneXmlTest, InvalidElementNamesAreRefused) {
  const std::string f = path("names.xml");
  orvanexml doc(f);
  const int one = 1;
  EXPECT_EQ(doc.writeInt(1, "Tool/bad name", &one, 1), 1);
  EXPECT_EQ(doc.writeInt(1, "Tool/9lives", &one, 1), 1);
  EXPECT_EQ(doc.writeInt(1, "", &one, 1), 1);
  EXPECT_EQ(doc.getNumberOfChannels(), 0);
  EXPECT_EQ(doc.writeInt(1, "Tool/good-name_2", &one, 1), 0);
  ASSERT_EQ(doc.write(), 0);
  orvanexml back(f);
  EXPECT_TRUE(back.isRecognised());
  int v = 0;
  EXPECT_EQ(back.readInt(1, "Tool/good-name_2", &v, 1), 0);
  EXPECT_EQ(v, 1);
  if (haveXmllint()) {
    EXPECT_TRUE(xmllintAccepts(f));
  }
}

}  // namespace
