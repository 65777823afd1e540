#include "ingest/product_types.h"
#include "ingest/ers/ers_types.h"
#include "ingest/palsar/palsar_types.h"

#include <gtest/gtest.h>

#include <cstring>

#include "ingest_test_util.h"
#include "product/roi.h"
#include "product/time_base.h"

using ingest_test::blankWith;
using ingest_test::mphHead;
using ingest_test::realData;
using ingest_test::TempFolder;
using ingest_test::writeBytes;

TEST(EnvisatTypesTest, EveryProductPrefixHasItsTypeNumber) {
  TempFolder dir;
  const char* names[] = {"ASA_APS_1P", "ASA_APP_1P", "ASA_APM_1P", "ASA_APC_0P", "ASA_APH_0P",
                         "ASA_APV_0P", "ASA_IMS_1P", "ASA_IM__0C", "ASA_WSS_1P", "ASA_WSM_1P",
                         "ASA_WS__0C", "DOR_VOR_AX", "DOR_POR_AX", "ASA_XCA_AX", "ASA_XCH_AX",
                         "ASA_INS_AX"};
  for (int k = 0; k < 16; ++k) {
    const std::string path = dir / std::string("p").append(std::to_string(k));
    writeBytes(path, mphHead(names[k]));
    EXPECT_EQ(EnvisatTypes(path).find_type(), k + 1) << names[k];
  }
  const EnvisatTypes im0(dir / "p7");
  EXPECT_EQ(im0.is_im0(), 1);
  EXPECT_EQ(im0.is_ims(), 0);
  EXPECT_EQ(im0.is_ws0(), 0);
  // Case counts; an image-mode name without the level-0 marker is not level 0.
  writeBytes(dir / "lower", mphHead("asa_im__0C"));
  EXPECT_EQ(EnvisatTypes(dir / "lower").find_type(), 0);
  writeBytes(dir / "im1", mphHead("ASA_IM__1P"));
  EXPECT_EQ(EnvisatTypes(dir / "im1").is_im0(), 0);
  // Unreadable or short files pass no test.
  EXPECT_EQ(EnvisatTypes(dir / "absent").find_type(), 0);
  writeBytes(dir / "short", "PRODUCT=\"ASA_IM__0CNPDE");
  EXPECT_EQ(EnvisatTypes(dir / "short").is_im0(), 0);
}

TEST(EnvisatTypesTest, SensingExtent) {
  TempFolder dir;
  writeBytes(dir / "im0", mphHead("ASA_IM__0CNPDE", "02-MAR-2008 10:00:00.250000", "02-MAR-2008 10:00:16.750000"));
  ROI_Obj roi;
  ASSERT_EQ(EnvisatTypes(dir / "im0").read_roi(&roi), 1);
  // 25 characters of the value are read: the last digit of the microseconds is cut.
  EXPECT_DOUBLE_EQ(roi.SlowStartTime, ascii2sec85("02-MAR-2008 10:00:00.25000"));
  EXPECT_DOUBLE_EQ(roi.SlowTimeLength, ascii2sec85("02-MAR-2008 10:00:16.75000") - roi.SlowStartTime);
  EXPECT_EQ(roi.Lines, -1);
  EXPECT_EQ(roi.Samples, -1);
  EXPECT_EQ(roi.SlowTimeDelta, -1.0);
  EXPECT_EQ(roi.FastStartTime, -1.0);
  EXPECT_EQ(roi.FastTimeLength, -1.0);
  EXPECT_EQ(roi.FastTimeDelta, -1.0);
  EXPECT_EQ(EnvisatTypes(dir / "absent").read_roi(&roi), 0);
}

TEST(EnvisatTypesTest, RealProductHeads) {
  if (!ingest_test::realDataPresent()) GTEST_SKIP() << "real data folder absent";
  const std::string im0 = std::string(realData()) +
                          "/envisat/ASA_IM__0CNPDE20120329_071134_000000163113_00121_52721_6279.N1";
  const std::string xca = std::string(realData()) +
                          "/envisat/ASA_XCA_AXVIEC20070517_153558_20070204_165113_20071231_000000";
  const std::string dor = std::string(realData()) +
                          "/orbits/DOR_VOR_AXVF-P20080331_075200_20080301_215527_20080303_002327";
  EXPECT_EQ(EnvisatTypes(im0).find_type(), 8);
  EXPECT_EQ(EnvisatTypes(xca).find_type(), 14);
  EXPECT_EQ(EnvisatTypes(dor).find_type(), 12);
  ROI_Obj roi;
  ASSERT_EQ(EnvisatTypes(im0).read_roi(&roi), 1);
  EXPECT_DOUBLE_EQ(roi.SlowStartTime, ascii2sec85("29-MAR-2012 07:11:34.4328"));
  EXPECT_DOUBLE_EQ(roi.SlowTimeLength, ascii2sec85("29-MAR-2012 07:11:50.6678") - roi.SlowStartTime);
  EXPECT_EQ(EnvisatTypes(im0).check_dorvor(dor), 0);
}

TEST(ErsTypesTest, RealLeaders) {
  if (!ingest_test::realDataPresent()) GTEST_SKIP() << "real data folder absent";
  const std::string root = realData();
  const ErsTypes ers1(root + "/ers1_2000_orbit44928");
  const ErsTypes ers2(root + "/ers2_2010_orbit77106");
  EXPECT_EQ(ers1.find_type(), 1);
  EXPECT_EQ(ers2.find_type(), 2);
  EXPECT_EQ(ers1.is_level0(), 1);
  EXPECT_EQ(ers2.is_level0(), 1);
  EXPECT_EQ(ers1.is_deos(root + "/orbits/ers1_ODR.079"), 1);
  EXPECT_EQ(ers1.check_deos(root + "/orbits/ers1_ODR.079"), 1);
  EXPECT_EQ(ers1.check_deos(root + "/orbits/ers2_ODR.015"), 0);
  EXPECT_EQ(ers2.check_deos(root + "/orbits/ers2_ODR.015"), 1);
  EXPECT_EQ(ers2.check_deos(root + "/orbits/envisat_ODR.051"), 0);
  EXPECT_EQ(ers2.is_deos(root + "/orbits/envisat_ODR.051"), 1);

  ROI_Obj roi;
  ASSERT_EQ(ers1.read_roi(&roi), 1);
  const double first = ascii2sec85("17-FEB-2000 09:57:26.417");
  EXPECT_DOUBLE_EQ(roi.SlowStartTime, first);
  EXPECT_DOUBLE_EQ(roi.SlowTimeLength, ascii2sec85("17-FEB-2000 09:57:43.084") - first);
  EXPECT_DOUBLE_EQ(roi.SlowTimeDelta, 1.0 / 1679.902);
  EXPECT_DOUBLE_EQ(roi.FastStartTime, 5.550316 / 1000.0);
  EXPECT_DOUBLE_EQ(roi.FastTimeLength, 5.84648 / 1000.0 - 5.550316 / 1000.0);
  EXPECT_DOUBLE_EQ(roi.FastTimeDelta, 1.0 / 18.962468 * 1000000.0);
  EXPECT_EQ(roi.Lines, roundHalfAway(roi.SlowTimeLength * 1679.902));
  EXPECT_EQ(roi.Lines, 27999);
  EXPECT_EQ(roi.Samples, 0);
}

TEST(PalsarTypesTest, LayoutsAndPolarisations) {
  TempFolder dir;
  // JAXA leader, dual polarisation, channel HV in the image file.
  writeBytes(dir / "jaxa.lea", blankWith(2700, {{1108, "   2"}, {1830, "UNPROCESSED"}, {2606, "JAXA  "}}));
  std::string image(1000, '\0');
  image[773] = 0;
  image[775] = 1;
  writeBytes(dir / "jaxa.img", image);
  const PalsarTypes jaxa(dir / "jaxa.lea", dir / "jaxa.img");
  EXPECT_EQ(jaxa.is_level0(), 1);
  EXPECT_EQ(jaxa.is_ersdac(), 0);
  EXPECT_EQ(jaxa.is_doublepol(), 1);
  EXPECT_EQ(jaxa.is_singlepol() + jaxa.is_quadpol(), 0);
  EXPECT_EQ(jaxa.find_type(), 2);
  EXPECT_EQ(jaxa.getPol(), 1);
  EXPECT_EQ(jaxa.get_ersdac_Pol(3), 1);
  image[773] = 1;
  image[775] = 1;
  writeBytes(dir / "vv.img", image);
  EXPECT_EQ(PalsarTypes(dir / "jaxa.lea", dir / "vv.img").getPol(), 3);
  image[773] = 2;
  writeBytes(dir / "odd.img", image);
  EXPECT_EQ(PalsarTypes(dir / "jaxa.lea", dir / "odd.img").getPol(), 4);
  EXPECT_EQ(PalsarTypes(dir / "jaxa.lea", dir / "absent.img").getPol(), 4);

  // ERSDAC: count in the image file, polarisation order by a 16-bit word.
  writeBytes(dir / "ersdac.lea", blankWith(2700, {{1108, "   1"}, {2606, "VEXCEL"}}));
  std::string quad(16400, ' ');
  quad.replace(232, 4, "   6");
  const unsigned short swapped = 1;
  std::memcpy(quad.data() + 16304, &swapped, 2);
  writeBytes(dir / "quad.img", quad);
  const PalsarTypes ersdac(dir / "ersdac.lea", dir / "quad.img");
  EXPECT_EQ(ersdac.is_ersdac(), 1);
  EXPECT_EQ(ersdac.find_type(), 3);
  EXPECT_EQ(ersdac.get_ersdac_Pol(0), 2);
  EXPECT_EQ(ersdac.get_ersdac_Pol(1), 3);
  EXPECT_EQ(ersdac.get_ersdac_Pol(2), 0);
  EXPECT_EQ(ersdac.get_ersdac_Pol(3), 1);
  quad.replace(232, 4, "   3");
  const unsigned short straight = 0;
  std::memcpy(quad.data() + 16304, &straight, 2);
  writeBytes(dir / "dual.img", quad);
  const PalsarTypes dual(dir / "ersdac.lea", dir / "dual.img");
  EXPECT_EQ(dual.find_type(), 2);
  EXPECT_EQ(dual.get_ersdac_Pol(1), 1);
  EXPECT_EQ(dual.get_ersdac_Pol(2), 4);

  // ScanSAR wide beam.
  writeBytes(dir / "wide.lea", blankWith(2700, {{1108, "   9"}, {1144, "61"}, {1436, "32"}}));
  EXPECT_EQ(PalsarTypes(dir / "wide.lea", dir / "jaxa.img").find_type(), 4);

  // The layout test reports its file failures.
  EXPECT_EQ(PalsarTypes(dir / "absent.lea", dir / "jaxa.img").is_ersdac(), 9);
  writeBytes(dir / "short.lea", std::string(2608, ' '));
  EXPECT_EQ(PalsarTypes(dir / "short.lea", dir / "jaxa.img").is_ersdac(), 4);
}
