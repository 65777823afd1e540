#include "product/general_sar_configuration.h"

#include <gtest/gtest.h>

#include <fstream>

#include "diag/orvane_exception.h"
#include "record_test_util.h"

namespace {

class NoOrbit : public GeneralSAR_Base {};
class NoOrbitSlots : public GeneralSAROrbitSlots {
 public:
  std::unique_ptr<GeneralSAR_Base> makeStateVectors() const override {
    return std::make_unique<NoOrbit>();
  }
  std::unique_ptr<GeneralSAR_Base> makeOrbit() const override { return std::make_unique<NoOrbit>(); }
  void setLambda(GeneralSAR_Base&, double) const override {}
  void setOrbitLookSign(GeneralSAR_Base&, int) const override {}
  void setStateVectorsLookSign(GeneralSAR_Base&, int) const override {}
  void destroyOrbit(GeneralSAR_Base&) const override {}
  void destroyStateVectors(GeneralSAR_Base&) const override {}
};
const NoOrbitSlots kSlots;

TEST(Configuration, PartialDocumentAndFailures) {
  const std::string dir = record_test::freshDir();
  const std::string file = dir + "/only_azimuth.xml";
  AzimuthConf a;
  a.SamplesInBlock = 512;
  ASSERT_EQ(a.writepar(file, 1), 0);
  GeneralSAR_configuration c;
  ASSERT_NO_THROW(c.GSread(file, 1));
  EXPECT_TRUE(c.GSexists(GeneralSAR_configuration::GSC_AZIMUTH));
  EXPECT_EQ(c.azimuthConf.SamplesInBlock, 512);
  for (int i = 1; i < GeneralSAR_configuration::kObjects; ++i)
    EXPECT_FALSE(c.GSexists(static_cast<GeneralSAR_configuration::GScObject>(i))) << i;
  // Another channel holds nothing.
  GeneralSAR_configuration other;
  other.GSread(file, 2);
  EXPECT_FALSE(other.GSexists(GeneralSAR_configuration::GSC_AZIMUTH));

  DCestConf dc;
  try {
    dc.readpar(file, 1);
    FAIL() << "no exception";
  } catch (const orvaneException& e) {
    EXPECT_EQ(e.getMessage(), "Cannot read input file");
  }
  EnvisatCalibrationFactors f;
  try {
    f.readpar(file, 1);
    FAIL() << "no exception";
  } catch (const orvaneException& e) {
    EXPECT_EQ(e.getMessage(), "Cannot read specific configuration file");
  }
  testing::internal::CaptureStderr();
  EXPECT_EQ(c.GSread(dir + "/missing.xml", 1), 9);
  testing::internal::GetCapturedStderr();
  EXPECT_TRUE(c.GSexists(GeneralSAR_configuration::GSC_AZIMUTH));
}

TEST(Configuration, CalibrationFactorOfAsarProducts) {
  EnvisatCalibrationFactors f;
  for (int i = 0; i < 7; ++i) {
    f.IM_HH[i] = 100 + i;
    f.IM_VV[i] = 200 + i;
    f.AP_HH[i] = 300 + i;
    f.AP_HV[i] = 400 + i;
    f.AP_VH[i] = 500 + i;
    f.AP_VV[i] = 600 + i;
  }
  GeneralSAR gs(kSlots);
  DataSetInfo_Obj& d = gs.dataSetInfo;
  d.SetType(DataSetInfo_Obj::IT_AZIMUTH_FOCUSED, DataSetInfo_Obj::ST_ASAR,
            DataSetInfo_Obj::AM_STRIPMAP, DataSetInfo_Obj::PR_SLANT_RANGE,
            DataSetInfo_Obj::UT_VOLTCOMPLEX, 0);
  d.Swath = "IS3";
  d.Polarization = "V/V";
  ASSERT_EQ(f.writeFactor(&gs), 0);
  EXPECT_EQ(d.ExternalCalibrationFactor, 202.0);
  d.Swath = "SS1";  // only the digit counts
  d.Polarization = "H/H";
  ASSERT_EQ(f.writeFactor(&gs), 0);
  EXPECT_EQ(d.ExternalCalibrationFactor, 100.0);
  d.Polarization = "H/V";
  d.ExternalCalibrationFactor = 1.0;
  EXPECT_EQ(f.writeFactor(&gs), 1);
  EXPECT_EQ(d.ExternalCalibrationFactor, 1.0);
  d.Swath = "IS8";
  d.Polarization = "H/H";
  EXPECT_EQ(f.writeFactor(&gs), 1);

  d.SetAcqMode(DataSetInfo_Obj::AM_DOUBLE_POLARIZATION);
  d.SetImageType(DataSetInfo_Obj::IT_MULTILOOK);
  d.Swath = "IS7";
  d.Polarization = "V/H";
  ASSERT_EQ(f.writeFactor(&gs), 0);
  EXPECT_EQ(d.ExternalCalibrationFactor, 506.0);
  d.SetSensorType(DataSetInfo_Obj::ST_ERS2);
  EXPECT_EQ(f.writeFactor(&gs), 1);
  d.SetSensorType(DataSetInfo_Obj::ST_ASAR);
  d.SetImageType(DataSetInfo_Obj::IT_RANGE_FOCUSED);
  EXPECT_EQ(f.writeFactor(&gs), 1);

  // Through a record file.
  const std::string dir = record_test::freshDir();
  d.SetImageType(DataSetInfo_Obj::IT_AZIMUTH_FOCUSED);
  gs.GSenable(GeneralSAR::GS_DATASETINFO);
  ASSERT_EQ(gs.GSwrite(dir + "/p.hdr"), 0);
  ASSERT_EQ(f.writeFactor(dir + "/p.hdr", kSlots), 0);
  GeneralSAR back(kSlots);
  back.GSread(dir + "/p.hdr");
  EXPECT_EQ(back.dataSetInfo.ExternalCalibrationFactor, 506.0);
}

}  // namespace
