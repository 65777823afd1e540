#include "product/general_sar.h"

#include <gtest/gtest.h>

#include <vector>

#include "product/profile.h"
#include "record_test_util.h"

namespace {

using record_test::g15;

// Stand-ins for the orbit members (their own library is built above this one).
class FakeOrbit : public GeneralSAR_Base {
 public:
  explicit FakeOrbit(const char* className) : className_(className) { createElementsVector(2); }
  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override {
    ++destroyed;
    return 0;
  }
  void refreshParameters() override {
    addElementInt("nSV_n", &nSV, 1, 0, 1000, true);
    addElementDouble("t0SV_s", &t0, 1, -1e300, 1e300, true);
    setAllocationFlag(true);
  }
  using GeneralSAR_Base::writehdr;
  int readhdr(const std::string& file) override {
    return readAuxiliaryFile(file, 1, className_) ? 0 : 1;
  }
  int writehdr(const std::string& file) override {
    return writeAuxiliaryFile(file, 1, className_);
  }
  std::string className_;
  int nSV = 0;
  double t0 = 0.0;
  double lambda = 0.0;
  int lookSign = 1;
  int destroyed = 0;
};

class FakeSlots : public GeneralSAROrbitSlots {
 public:
  std::unique_ptr<GeneralSAR_Base> makeStateVectors() const override {
    return std::make_unique<FakeOrbit>("FakeStateVectors");
  }
  std::unique_ptr<GeneralSAR_Base> makeOrbit() const override {
    return std::make_unique<FakeOrbit>("StateVectorData");
  }
  void setLambda(GeneralSAR_Base& o, double l) const override {
    static_cast<FakeOrbit&>(o).lambda = l;
  }
  void setOrbitLookSign(GeneralSAR_Base& o, int s) const override {
    static_cast<FakeOrbit&>(o).lookSign = s;
  }
  void setStateVectorsLookSign(GeneralSAR_Base& o, int s) const override {
    static_cast<FakeOrbit&>(o).lookSign = s;
  }
  void destroyOrbit(GeneralSAR_Base& o) const override { o.destroyBuffers(); }
  void destroyStateVectors(GeneralSAR_Base& o) const override { o.destroyBuffers(); }
};

const FakeSlots kSlots;

FakeOrbit& fake(GeneralSAR& gs, GeneralSAR::GSObject o) {
  return static_cast<FakeOrbit&>(*gs.GSget(o));
}

void fillRecord(GeneralSAR& gs, const std::string& rasterName) {
  gs.dataFile.filename = rasterName;
  gs.dataFile.NrOfPixelsPerLine = 5616;
  gs.dataFile.NrOfLinesPerImage = 28000;
  gs.dataFile.RowPrefix = 4;
  gs.dataFile.CellType = SHORT_COMPLEX;
  gs.roi.roi.SetFastAxe(5.5503160e-3, 1 / 18.962468e6, 5616);
  gs.roi.roi.SetSlowAxe(476789846.417, 1 / 1679.902, 28000);
  gs.polynomials.CreatePolys(2, 1, 1, 1, 1, 1);
  for (int k = 0; k < 2; ++k) {
    gs.polynomials.DC[k].c[0] = 120.5 + k;
    gs.polynomials.DC[k].c[1] = -3.25e5;
    gs.polynomials.DC[k].taz0 = 476789846.417 + 8 * k;
    gs.polynomials.DC[k].trg0 = 5.6e-3;
  }
  gs.polynomials.FR[0].c[0] = -2210.75;
  gs.polynomials.SL2PHI[0].c[4] = 1.5e9;
  gs.sampling.fc_hz = 5.3e9;
  gs.sampling.frg_hz = 18.962468e6;
  gs.sampling.Brg_hz = 15.55e6;
  gs.sampling.Trg_s = 1 / 18.962468e6;
  gs.sampling.prf_hz = 1679.902;
  gs.sampling.pri_s = 1 / 1679.902;
  gs.sampling.Baz_hz = 1378.0;
  gs.sampling.brf_hz = 0.0;
  gs.sampling.bri_s = 0.0;
  gs.sampling.lambda_m = 299792458.0 / 5.3e9;
  fake(gs, GeneralSAR::GS_STATEVECTORS).nSV = 5;
  fake(gs, GeneralSAR::GS_ORBIT).nSV = 7;
  fake(gs, GeneralSAR::GS_ORBIT).t0 = 476789800.0;
  gs.pulse.PulseLength = 37.12e-6;
  gs.pulse.Bandwidth = 15.55e6;
  gs.pulse.PulseKRate = 4.18894e11;
  gs.pulse.PulseEnergy = 1.0;
  gs.pulse.PulseSamplingRate = 18.962468e6;
  gs.antenna.StartAngle = 14.5;
  gs.antenna.DeltaAngle = 0.05;
  gs.antenna.PatternSamples = 201;
  gs.dataSetInfo.OrbitNumber = "44928";
  gs.dataSetInfo.SenseDate = "17-FEB-2000 09:57:26.417000";
  gs.dataSetInfo.Polarization = "V/V";
  gs.dataSetInfo.SceneHeading = 194.302;
  gs.dataSetInfo.RangeBandwidth[0] = 15.55e6;
  gs.dataSetInfo.ExternalCalibrationFactor = 0.25;
  gs.dataSetInfo.SetType(DataSetInfo_Obj::IT_RAW_DATA, DataSetInfo_Obj::ST_ERS1,
                         DataSetInfo_Obj::AM_STRIPMAP, DataSetInfo_Obj::PR_SLANT_RANGE,
                         DataSetInfo_Obj::UT_VOLTCOMPLEX, DataSetInfo_Obj::RS_UNDEFINED);
  gs.dataSetInfo.MissingLines = 3;
  gs.dataSetInfo.LookDirection = 1;
  gs.attitude.Eq_speed = 7040.125;
  gs.attitude.Eq_distance = 851234.5;
  gs.attitude.Mean_DC = 120.0;
  gs.attitude.SquintAngle = 0.0;
  gs.attitude.AntennaLength = 10.0;
  gs.attitude.DroopGain[5] = 0.5;
  gs.attitude.Temperature = 21.0;
  gs.spectralWindows.AzMatchedFilterType = "HAMMING";
  gs.spectralWindows.RgMatchedFilterType = "HAMMING";
  gs.spectralWindows.RgMatchedFilterCoef = 0.75;
  gs.spectralWindows.AzMatchedFilterCoef = 0.75;
  gs.spectralWindows.RgLookBandwidth = 14e6;
  gs.spectralWindows.AzLookBandwidth = 1200.0;
  gs.geoCoords.NW.set(41.8, 12.0, 0.0, 19.4, 17.2);
  gs.geoCoords.center.set(41.3, 12.4, 0.0, 23.4, 20.9);
  gs.geoCoords.EastingGridSize = 20.0;
  gs.geoCoords.NorthingGridSize = 4.0;
  gs.swath.Rank = 9;
  gs.swath.Rgate_bias = 0.0;
  gs.swath.Echoes_per_burst = 1;
  gs.swath.Lines_per_burst = 1;
  gs.swath.Bursts = 1;
  gs.swath.Order = 0;
  gs.swath.Acquisition_Start_Time = 476789846.417;
  gs.swath.Swst_changes = 2;
  gs.swath.createBuffers();
  gs.swath.Swst_changes_bursts = {100, 2000};
}

void expectSameRecord(GeneralSAR& a, GeneralSAR& b) {
  EXPECT_EQ(b.dataFile.NrOfPixelsPerLine, a.dataFile.NrOfPixelsPerLine);
  EXPECT_EQ(b.dataFile.NrOfLinesPerImage, a.dataFile.NrOfLinesPerImage);
  EXPECT_EQ(b.dataFile.RowPrefix, a.dataFile.RowPrefix);
  EXPECT_EQ(b.dataFile.CellType, a.dataFile.CellType);
  const ROI_Obj& r = a.roi.roi;
  const ROI_Obj& s = b.roi.roi;
  EXPECT_EQ(g15(s.FastStartTime), g15(r.FastStartTime));
  EXPECT_EQ(g15(s.SlowStartTime), g15(r.SlowStartTime));
  EXPECT_EQ(g15(s.FastTimeDelta), g15(r.FastTimeDelta));
  EXPECT_EQ(g15(s.SlowTimeDelta), g15(r.SlowTimeDelta));
  EXPECT_EQ(g15(s.FastTimeLength), g15(r.FastTimeLength));
  EXPECT_EQ(g15(s.SlowTimeLength), g15(r.SlowTimeLength));
  EXPECT_EQ(s.Samples, r.Samples);
  EXPECT_EQ(s.Lines, r.Lines);
  ASSERT_EQ(b.polynomials.ndc, 2);
  EXPECT_EQ(b.polynomials.nfr, 1);
  EXPECT_EQ(b.polynomials.nsl2phi, 1);
  for (int k = 0; k < 2; ++k) {
    for (int i = 0; i < 7; ++i)
      EXPECT_EQ(g15(b.polynomials.DC[k].c[i]), g15(a.polynomials.DC[k].c[i]));
    EXPECT_EQ(g15(b.polynomials.DC[k].taz0), g15(a.polynomials.DC[k].taz0));
    EXPECT_EQ(g15(b.polynomials.DC[k].trg0), g15(a.polynomials.DC[k].trg0));
  }
  EXPECT_EQ(b.polynomials.FR[0].c[0], a.polynomials.FR[0].c[0]);
  EXPECT_EQ(b.polynomials.SL2PHI[0].c[4], a.polynomials.SL2PHI[0].c[4]);
  const double sa[] = {a.sampling.fc_hz,  a.sampling.frg_hz, a.sampling.Brg_hz, a.sampling.Trg_s,
                       a.sampling.prf_hz, a.sampling.pri_s,  a.sampling.Baz_hz, a.sampling.brf_hz,
                       a.sampling.bri_s,  a.sampling.lambda_m};
  const double sb[] = {b.sampling.fc_hz,  b.sampling.frg_hz, b.sampling.Brg_hz, b.sampling.Trg_s,
                       b.sampling.prf_hz, b.sampling.pri_s,  b.sampling.Baz_hz, b.sampling.brf_hz,
                       b.sampling.bri_s,  b.sampling.lambda_m};
  for (int i = 0; i < 10; ++i) EXPECT_EQ(g15(sb[i]), g15(sa[i])) << i;
  EXPECT_EQ(g15(b.pulse.PulseLength), g15(a.pulse.PulseLength));
  EXPECT_EQ(g15(b.pulse.Bandwidth), g15(a.pulse.Bandwidth));
  EXPECT_EQ(g15(b.pulse.PulseKRate), g15(a.pulse.PulseKRate));
  EXPECT_EQ(g15(b.pulse.PulseEnergy), g15(a.pulse.PulseEnergy));
  EXPECT_EQ(g15(b.pulse.PulseSamplingRate), g15(a.pulse.PulseSamplingRate));
  EXPECT_EQ(b.antenna.StartAngle, a.antenna.StartAngle);
  EXPECT_EQ(b.antenna.DeltaAngle, a.antenna.DeltaAngle);
  EXPECT_EQ(b.dataSetInfo.OrbitNumber, "44928");
  EXPECT_EQ(b.dataSetInfo.SenseDate, a.dataSetInfo.SenseDate);
  EXPECT_EQ(b.dataSetInfo.Polarization, "V/V");
  EXPECT_EQ(b.dataSetInfo.SceneHeading, 194.302);
  EXPECT_EQ(b.dataSetInfo.RangeBandwidth[0], 15.55e6);
  EXPECT_EQ(b.dataSetInfo.ExternalCalibrationFactor, 0.25);
  EXPECT_TRUE(b.dataSetInfo.IsType(DataSetInfo_Obj::IT_RAW_DATA, DataSetInfo_Obj::ST_ERS1,
                                    DataSetInfo_Obj::AM_STRIPMAP, DataSetInfo_Obj::PR_SLANT_RANGE,
                                    DataSetInfo_Obj::UT_VOLTCOMPLEX,
                                    DataSetInfo_Obj::RS_UNDEFINED));
  EXPECT_EQ(b.dataSetInfo.MissingLines, 3);
  EXPECT_EQ(b.attitude.Eq_speed, 7040.125);
  EXPECT_EQ(b.attitude.Eq_distance, 851234.5);
  EXPECT_EQ(b.attitude.DroopGain[5], 0.5);
  EXPECT_EQ(b.attitude.Temperature, 21.0);
  EXPECT_EQ(b.spectralWindows.RgMatchedFilterType, "HAMMING");
  EXPECT_EQ(b.spectralWindows.AzLookBandwidth, 1200.0);
  EXPECT_EQ(b.geoCoords.NW.lat, 41.8);
  EXPECT_EQ(b.geoCoords.center.look, 20.9);
  EXPECT_EQ(b.geoCoords.NE.lat, -999.0);
  EXPECT_EQ(b.geoCoords.EastingGridSize, 20.0);
  EXPECT_EQ(b.swath.Rank, 9);
  EXPECT_EQ(g15(b.swath.Acquisition_Start_Time), g15(a.swath.Acquisition_Start_Time));
  EXPECT_EQ(b.swath.Swst_changes_bursts, (std::vector<int>{100, 2000}));
}

TEST(GeneralSAR, FullRecordThroughTheElementDocument) {
  const std::string dir = record_test::freshDir();
  GeneralSAR gs(kSlots);
  for (int i = 0; i < GeneralSAR::kObjects; ++i)
    EXPECT_FALSE(gs.GSexists(static_cast<GeneralSAR::GSObject>(i)));
  fillRecord(gs, dir + "/scene");
  for (int i = 0; i < GeneralSAR::kObjects; ++i) gs.GSenable(static_cast<GeneralSAR::GSObject>(i));
  ASSERT_EQ(gs.GSwrite(dir + "/scene.hdr"), 0);

  GeneralSAR back(kSlots);
  ASSERT_EQ(back.GSread(dir + "/scene.hdr"), 0);
  for (int i = 0; i < GeneralSAR::kObjects; ++i)
    EXPECT_TRUE(back.GSexists(static_cast<GeneralSAR::GSObject>(i))) << i;
  expectSameRecord(gs, back);
  EXPECT_EQ(fake(back, GeneralSAR::GS_ORBIT).nSV, 7);
  EXPECT_EQ(fake(back, GeneralSAR::GS_STATEVECTORS).nSV, 5);
  // Wavelength and look direction handed to the orbit members.
  EXPECT_EQ(g15(fake(back, GeneralSAR::GS_ORBIT).lambda), g15(gs.sampling.lambda_m));
  EXPECT_EQ(fake(back, GeneralSAR::GS_ORBIT).lookSign, 1);
  EXPECT_EQ(fake(back, GeneralSAR::GS_STATEVECTORS).lookSign, 1);
  EXPECT_EQ(back.dataSetInfo.LookDirection, 1);
  EXPECT_EQ(back.GSget(GeneralSAR::GS_SWATH), &back.swath);
  EXPECT_EQ(back.GSget(GeneralSAR::GS_BUFFERFILE), &back.bufferFile);

  // The destroy operations empty the arrays.
  const int destroyedBefore = fake(back, GeneralSAR::GS_ORBIT).destroyed;
  back.GSdestroy();
  EXPECT_EQ(back.polynomials.ndc, 0);
  EXPECT_TRUE(back.swath.Swst_changes_bursts.empty());
  EXPECT_EQ(fake(back, GeneralSAR::GS_ORBIT).destroyed, destroyedBefore + 1);
  back.GSdisable(GeneralSAR::GS_SWATH);
  EXPECT_FALSE(back.GSexists(GeneralSAR::GS_SWATH));
}

TEST(GeneralSAR, OldProfileFormHeader) {
  const std::string dir = record_test::freshDir();
  const std::string file = dir + "/old.hdr";
  record_test::writeText(
      file,
      "\n[RasterInfo]\nHeaderOffset = 0\nRowPrefix = 4\nNrOfPixelsPerLine = 5616\n"
      "NrOfLinesPerImage = 28000\nCellType = SHORT_COMPLEX\nByteOrder = LSBFirst\n"
      "\n[ROI]\nSlowStartTime = 476789846.417\nFastStartTime = 0.005550316\n"
      "SlowTimeDelta = 0.000595272819485899\nFastTimeDelta = 5.27357811491443e-08\n"
      "SlowTimeLength = 16.6676389456052\nFastTimeLength = 0.000296164146933614\n"
      "Lines = 28000\nSamples = 5616\n"
      "\n[PolySAR]\nnDopCenDataSet = 1\nnFMRateDataSet = 1\n"
      "\n[DopplerCentroid-0]\nDCpoly = {120.5 -325000 0 0 0 0 0}\nDCpoly_rgt0 = 0.0056\n"
      "DCpoly_azt0 = 476789846.417\n"
      "\n[DopplerRate-0]\nFRpoly = {-2210.75 0 0 0 0 0 0}\nFRPoly_rgt0 = 0.0056\n"
      "FRpoly_azt0 = 476789846.417\n"
      "\n[SamplingConstants]\nCarrierFrequency = 5300000000\nSamplingRate = 18962468\n"
      "RangeBandWidth = 15550000\nRangeTSamplingStep = 5.27357811491443e-08\nPRF = 1679.902\n"
      "PRI = 0.000595272819485899\nAzimuthBandwidth = 1378\nBRF = 0\nBRI = 0\n"
      "WaveLength = 0.0565646147169811\n"
      "\n[Pulse]\nPulseLength = 3.712e-05\nBandwidth = 15550000\nPulseKRate = 418894000000\n"
      "PulseEnergy = 1\nPulseSamplingRate = 18962468\n"
      "\n[DataSetInfo]\nOrbitNumber = 44928\nTrack = 12\nSenseDate = 17-FEB-2000 09:57:26.417000\n"
      "SceneID = x\nDescription = d\nAcquisitionStation = I-PAF\nProcessingCenter = c\n"
      "ProcessingDate = p\nProcessingSoftware = s\nSceneHeading = 194.302\n"
      "OrbitConfiguration = DESCENDING\nPolarization = V/V\nSwath = NOT_AVAILABLE\n"
      "SWST_MIN = 0.0055\nSWST_MAX = 0.0056\nRO_REF = 850000\nRangeLooks = 1\n"
      "RangeBandwidth = {15550000 0 0 0 0}\nExternalCalibrationFactor = 1\n"
      "Projection = SLANT RANGE\nImageType = RAW DATA\n"
      "\n[SensorAttitude]\nEq_speed = 7040.125\nEq_distance = 851234.5\nMean_DC = 120\n"
      "SquintAngle = 0\nAntennaLength = 10\nDroopGain = {0 0 0 0 0 0.5 0 0}\nTemperature = 21\n"
      "\n[GeoGridSize]\nEastingGridSize = 20\nNorthingGridSize = 4\n"
      "\n[Coordinates]\nNorthWest = {41.8 12 0 19.4 17.2}\n");
  GeneralSAR gs(kSlots);
  ASSERT_EQ(gs.GSread(file), 0);
  const GeneralSAR::GSObject present[] = {
      GeneralSAR::GS_DATAFILE, GeneralSAR::GS_ROI,         GeneralSAR::GS_POLYNOMIALS,
      GeneralSAR::GS_SAMPLING, GeneralSAR::GS_PULSE,       GeneralSAR::GS_DATASETINFO,
      GeneralSAR::GS_ATTITUDE, GeneralSAR::GS_GEOCOORDS};
  for (int i = 0; i < GeneralSAR::kObjects; ++i) {
    bool expected = false;
    for (auto o : present) expected = expected || o == i;
    EXPECT_EQ(gs.GSexists(static_cast<GeneralSAR::GSObject>(i)), expected) << i;
  }
  EXPECT_EQ(gs.dataFile.NrOfPixelsPerLine, 5616);
  EXPECT_EQ(gs.dataFile.CellType, SHORT_COMPLEX);
  EXPECT_EQ(gs.roi.roi.Lines, 28000);
  EXPECT_EQ(gs.roi.roi.SlowStartTime, 476789846.417);
  EXPECT_EQ(gs.polynomials.DC[0].c[1], -325000.0);
  EXPECT_EQ(gs.polynomials.FR[0].trg0, 0.0056);
  EXPECT_EQ(gs.sampling.prf_hz, 1679.902);
  EXPECT_EQ(gs.pulse.PulseKRate, 418894000000.0);
  EXPECT_TRUE(gs.dataSetInfo.IsImageType(DataSetInfo_Obj::IT_RAW_DATA));
  EXPECT_EQ(gs.dataSetInfo.LookDirection, 0);
  EXPECT_EQ(gs.attitude.DroopGain[5], 0.5);
  EXPECT_EQ(gs.geoCoords.NW.incidence, 19.4);
  EXPECT_EQ(gs.geoCoords.SE.lat, -999.0);
}

}  // namespace
