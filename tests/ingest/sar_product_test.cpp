#include "ingest/sar_product.h"
#include "ingest/ers/ers_level0.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <filesystem>

#include "ingest_test_util.h"
#include "product/antenna_pattern.h"
#include "product/time_base.h"

using ingest_test::blankWith;
using ingest_test::mphHead;
using ingest_test::TempFolder;
using ingest_test::writeBytes;

namespace {

// One line of an arc list: number, end of validity at column 20, start of
// validity with seconds at column 63 (dates as YYMMDD).
std::string arcLine(int number, const char* end, const char* beginWithSeconds) {
  std::string line(80, ' ');
  char num[8];
  std::snprintf(num, sizeof num, "%4d", number);
  line.replace(0, 4, num);
  line.replace(5, 13, std::string(" ") + std::string(beginWithSeconds).substr(0, 12));
  line.replace(20, 13, std::string(" ") + end);
  line.replace(36, 8, " 35  1.0");
  line.replace(63, 16, std::string(" ") + beginWithSeconds);
  return line + "\n";
}

std::string arcHead() {
  std::string head;
  for (int k = 0; k < 22; ++k) head += std::string(79, k % 2 ? '-' : '#') + "\n";
  return head;
}

}  // namespace

TEST(SarProductTest, DeosArcChoice) {
  TempFolder root;
  const std::string list = root / "ERS1/PRECISE/arclist";
  std::string text = arcHead();
  text += arcLine(7, "990110 12:00", "990105 12:00:00");
  text += "short line\n";
  text += arcLine(123, "050310 00:00", "050304 00:00:00");
  text += arcLine(124, "050315 00:00", "050309 00:00:00");
  writeBytes(list, text);
  Ers_DEOS arc;
  const double inArc7 = ascii2sec85("07-JAN-1999 00:00:00");
  ASSERT_EQ(arc.getDEOS(inArc7, 0, root.path()), 0);
  EXPECT_EQ(arc.fileName(), root / "ERS1/PRECISE/ODR.007");
  // ERS-2 reads the same list (under ERS1) and names its own folder.
  ASSERT_EQ(arc.getDEOS(ascii2sec85("06-MAR-2005 10:00:00"), 1, root.path()), 0);
  EXPECT_EQ(arc.fileName(), root / "ERS2/PRECISE/ODR.123");
  // Overlapping arcs: the whole list is read and the last match stands.
  ASSERT_EQ(arc.getDEOS(ascii2sec85("09-MAR-2005 12:00:00"), 1, root.path()), 0);
  EXPECT_EQ(arc.fileName(), root / "ERS2/PRECISE/ODR.124");
  // The bounds themselves do not qualify; nothing found leaves the name empty.
  ASSERT_EQ(arc.getDEOS(ascii2sec85("05-JAN-1999 12:00:00"), 0, root.path()), 0);
  EXPECT_EQ(arc.fileName(), "");
  ASSERT_EQ(arc.getDEOS(ascii2sec85("10-JAN-1999 12:00:00"), 0, root.path()), 0);
  EXPECT_EQ(arc.isValid(), 0);
  ASSERT_EQ(arc.getDEOS(ascii2sec85("01-JAN-2010 00:00:00"), 0, root.path()), 0);
  EXPECT_EQ(arc.isValid(), 0);

  // Bad arguments, missing list, bad month.
  EXPECT_EQ(arc.getDEOS(inArc7, 2, root.path()), 1);
  EXPECT_EQ(arc.getDEOS(-1.0, 0, root.path()), 1);
  EXPECT_EQ(arc.getDEOS(inArc7, 0, ""), 1);
  EXPECT_EQ(arc.getDEOS(inArc7, 0, root / "nowhere"), 9);
  writeBytes(list, arcHead() + arcLine(9, "991310 12:00", "990105 12:00:00"));
  EXPECT_EQ(arc.getDEOS(inArc7, 0, root.path()), 1);
  // Lines of the head are skipped by count, whatever they hold.
  writeBytes(list, arcLine(7, "990110 12:00", "990105 12:00:00") + arcHead());
  ASSERT_EQ(arc.getDEOS(inArc7, 0, root.path()), 0);
  EXPECT_EQ(arc.isValid(), 0);
}

TEST(SarProductTest, EnvisatAuxiliarySearches) {
  TempFolder aux;
  const std::string ins = "ASA_INS_AXVIEC";
  // Two valid instrument files: the newer generation wins.
  writeBytes(aux / (ins + "20070101_000000_20061201_000000_20080101_000000"), mphHead("ASA_INS_AX"));
  writeBytes(aux / (ins + "20070601_000000_20061201_000000_20080101_000000"), mphHead("ASA_INS_AX"));
  // Newer still, but an XCA inside: the content decides.
  writeBytes(aux / (ins + "20071201_000000_20061201_000000_20080101_000000"), mphHead("ASA_XCA_AX"));
  // Newest, but valid only from the scene time itself.
  writeBytes(aux / (ins + "20080101_000000_20070315_000000_20080101_000000"), mphHead("ASA_INS_AX"));
  writeBytes(aux / "ASA_XCH_AXVIEC20070201_000000_20070101_000000_20071231_000000", mphHead("ASA_XCH_AX"));
  const std::string xca = "ASA_XCA_AXVIEC20070517_153558_20070204_165113_20071231_000000";
  writeBytes(aux / xca, mphHead("ASA_XCA_AX"));
  const std::string dor = "DOR_VOR_AXVF-P20070401_000000_20070314_000000_20070316_000000";
  writeBytes(aux / dor, mphHead("DOR_VOR_AX"));
  std::filesystem::create_directories(aux / "subfolder");

  const double t = ascii2sec85("15-MAR-2007 00:00:00");
  Envisat_ASA_INS insFile;
  ASSERT_EQ(insFile.getASA_INS(t, aux.path()), 0);
  EXPECT_EQ(insFile.fileName(), aux / (ins + "20070601_000000_20061201_000000_20080101_000000"));
  double gen = 0, start = 0, stop = 0;
  ASSERT_EQ(insFile.parseASAfilename(&gen, &start, &stop), 0);
  EXPECT_DOUBLE_EQ(gen, ascii2sec85("01-JUN-2007 00:00:00"));
  EXPECT_DOUBLE_EQ(start, ascii2sec85("01-DEC-2006 00:00:00"));
  EXPECT_DOUBLE_EQ(stop, ascii2sec85("01-JAN-2008 00:00:00"));
  double v = 0.0;
  ASSERT_EQ(insFile.getTimeStart(&v), 0);
  EXPECT_DOUBLE_EQ(v, start);
  ASSERT_EQ(insFile.getTimeStop(&v), 0);
  EXPECT_DOUBLE_EQ(v, stop);

  Envisat_ASA_INS none;
  EXPECT_EQ(none.getTimeStart(&v), 1);
  EXPECT_EQ(none.getTimeStop(&v), 1);
  EXPECT_EQ(none.getASA_INS(ascii2sec85("01-JAN-2009 00:00:00"), aux.path()), 0);
  EXPECT_EQ(none.isValid(), 0);
  EXPECT_EQ(none.getASA_INS(t, aux / "absent"), 1);

  Envisat_ASA_XCH xchFile;
  ASSERT_EQ(xchFile.getASA_XCH(t, aux.path()), 0);
  EXPECT_EQ(xchFile.isValid(), 1);
  Envisat_ASA_XCA xcaFile;
  ASSERT_EQ(xcaFile.getASA_XCA(t, aux.path()), 0);
  // The content decides, not the name: the newer XCA is the one named INS.
  const std::string xcaNamedIns = aux / (ins + "20071201_000000_20061201_000000_20080101_000000");
  EXPECT_EQ(xcaFile.fileName(), xcaNamedIns);

  Envisat_DorVor orbit;
  EXPECT_EQ(orbit.getTimeStart(&v), 1);
  ASSERT_EQ(orbit.getDorVor(t, aux.path()), 0);
  EXPECT_EQ(orbit.fileName(), aux / dor);
  ASSERT_EQ(orbit.parseOrbitName(&start, &stop), 0);
  EXPECT_DOUBLE_EQ(start, ascii2sec85("14-MAR-2007 00:00:00"));
  EXPECT_DOUBLE_EQ(stop, ascii2sec85("16-MAR-2007 00:00:00"));
  ASSERT_EQ(orbit.getTimeStop(&v), 0);
  EXPECT_DOUBLE_EQ(v, stop);
  Envisat_DorVor noOrbit;
  EXPECT_EQ(noOrbit.getDorVor(-1.0, aux.path()), 1);
  EXPECT_EQ(noOrbit.getDorVor(t, ""), 1);
  EXPECT_EQ(noOrbit.getDorVor(t, aux / "absent"), 1);
  EXPECT_EQ(noOrbit.getDorVor(ascii2sec85("16-MAR-2007 00:00:00"), aux.path()), 0);
  EXPECT_EQ(noOrbit.isValid(), 0);

  // The level-0 product runs the searches of each selector.
  writeBytes(aux / "product.N1", mphHead("ASA_IM__0CNPDE", "15-MAR-2007 00:00:00.000000", "15-MAR-2007 00:00:16.000000"));
  Envisat_level0 scene;
  EXPECT_EQ(scene.getTimeStart(&v), 1);
  EXPECT_EQ(scene.getAuxFiles(0, aux.path()), 1);
  scene.setfileName(aux / "product.N1");
  ASSERT_EQ(scene.getTimeStop(&v), 0);
  EXPECT_DOUBLE_EQ(v, ascii2sec85("15-MAR-2007 00:00:16.0000"));
  ASSERT_EQ(scene.getAuxFiles(2, aux.path()), 0);
  EXPECT_EQ(scene.getASAINSFilename(), insFile.fileName());
  EXPECT_EQ(scene.getASAXCAFilename(), "");
  EXPECT_EQ(scene.isAuxValid(2), 1);
  EXPECT_EQ(scene.isAuxValid(3), 0);
  EXPECT_EQ(scene.isAuxValid(1), 1);
  ASSERT_EQ(scene.getAuxFiles(0, aux.path()), 0);
  EXPECT_EQ(scene.getASAXCAFilename(), xcaNamedIns);
  EXPECT_EQ(scene.getASAXCHFilename(), xchFile.fileName());
  EXPECT_EQ(scene.getOrbitFilename(), aux / dor);
  // The orbit term of the validity is the base's, never true.
  EXPECT_EQ(scene.isAuxValid(5), 0);
  EXPECT_EQ(scene.isAuxValid(4), 1);
  Envisat_level0 lost;
  lost.setfileName(aux / "product.N1");
  EXPECT_EQ(lost.getAuxFiles(1, aux / "absent"), 1);
}

TEST(SarProductTest, RealCalibrationPattern) {
  if (!ingest_test::realDataPresent()) GTEST_SKIP() << "real data folder absent";
  const std::string dir = std::string(ingest_test::realData()) + "/envisat";
  Envisat_ASA_XCA xca;
  AntennaPattern_Obj pattern;
  EXPECT_EQ(xca.readRgPattern(0, 0, &pattern), 0);  // no file: nothing read
  EXPECT_EQ(pattern.PatternSamples, -999);
  ASSERT_EQ(xca.getASA_XCA(ascii2sec85("01-JUN-2007 00:00:00"), dir), 0);
  ASSERT_TRUE(xca.isValid());
  ASSERT_EQ(xca.readRgPattern(0, 0, &pattern), 0);
  EXPECT_EQ(pattern.PatternSamples, 201);
  EXPECT_DOUBLE_EQ(pattern.DeltaAngle, 0.05);
  Envisat_ASA_XCA outside;
  ASSERT_EQ(outside.getASA_XCA(ascii2sec85("01-JUN-2008 00:00:00"), dir), 0);
  EXPECT_EQ(outside.isValid(), 0);
}
