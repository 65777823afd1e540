#include "product/acquisition_objects.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <fstream>
#include <vector>

#include "product/antenna_pattern.h"
#include "product/byte_order.h"
#include "product/buffer_io.h"
#include "product/data_file.h"
#include "product/data_set_info.h"
#include "product/geo_coords.h"
#include "product/time_base.h"
#include "record_test_util.h"

namespace {

using record_test::g15;

TEST(SARPulse, ChirpEnergyAndPhaseForBothSigns) {
  for (const double bw : {15.55e6, -15.55e6}) {
    SARPulse_Obj p;
    p.PulseLength = 37.12e-6;
    p.Bandwidth = bw;
    p.PulseSamplingRate = 18.96e6;
    const int n = p.chirpSamples();
    EXPECT_EQ(n, 704);  // 703.8 rounds up
    std::vector<fcomplex> c;
    ASSERT_EQ(p.generateChirp(c), 0);
    ASSERT_EQ(static_cast<int>(c.size()), n);
    double energy = 0.0;
    for (const auto& s : c) energy += std::norm(std::complex<double>(s));
    // Each sample has modulus 1/g with g^2 = n fs / |B|.
    const double g2 = n * p.PulseSamplingRate / std::fabs(bw);
    EXPECT_NEAR(energy * g2 / n, 1.0, 1e-5);
    // Quadratic phase centred on the pulse; the sign follows the bandwidth.
    const double t = (0 - (n - 1) * 0.5) / p.PulseSamplingRate;
    const double phase = bw * M_PI / p.PulseLength * t * t;
    EXPECT_NEAR(c[0].real() * std::sqrt(g2), std::cos(phase), 1e-4);
    EXPECT_NEAR(c[0].imag() * std::sqrt(g2), std::sin(phase), 1e-4);
    // Symmetric in time.
    EXPECT_NEAR(c[1].real(), c[n - 2].real(), 1e-6);
  }
  SARPulse_Obj bad;
  std::vector<fcomplex> c;
  bad.PulseLength = 0.0;
  bad.PulseSamplingRate = 1e6;
  bad.Bandwidth = 1e6;
  EXPECT_NE(bad.generateChirp(c), 0);
}

TEST(SARPulse, WriteChirpRaster) {
  const std::string dir = record_test::freshDir();
  SARPulse_Obj p;
  p.PulseLength = 10e-6;
  p.Bandwidth = 5e6;
  p.PulseSamplingRate = 12e6;
  ASSERT_EQ(p.writeChirp(dir + "/out.chirp"), 0);
  DataFile layout;
  ASSERT_EQ(layout.read_hdr(dir + "/out.chirp"), 0);
  EXPECT_EQ(layout.NrOfPixelsPerLine, 120);
  EXPECT_EQ(layout.NrOfLinesPerImage, 1);
  EXPECT_EQ(layout.CellType, FLOAT_COMPLEX);
  std::ifstream in(dir + "/out.chirp", std::ios::binary);
  std::vector<fcomplex> back(120);
  in.read(reinterpret_cast<char*>(back.data()), 120 * 8);
  ASSERT_TRUE(in);
  std::vector<fcomplex> ref;
  p.generateChirp(ref);
  for (int i = 0; i < 120; ++i) EXPECT_EQ(back[i], ref[i]);
}

TEST(AcquisitionObjects, ElementRoundTripAndProfileFallback) {
  const std::string dir = record_test::freshDir();
  const std::string file = dir + "/a.hdr";
  SamplingConstants_Obj s;
  s.fc_hz = 5.3e9;
  s.frg_hz = 18.962468e6;
  s.Brg_hz = 15.55e6;
  s.Trg_s = 1 / 18.962468e6;
  s.prf_hz = 1679.902;
  s.pri_s = 1 / 1679.902;
  s.Baz_hz = 1378.0;
  s.brf_hz = 0.0;
  s.bri_s = 0.0;
  s.lambda_m = 0.0565646;
  SensorAttitude_Obj a;
  a.Eq_speed = 7100.5;
  a.Eq_distance = 850000.25;
  a.Mean_DC = -120.75;
  a.SquintAngle = 0.01;
  a.AntennaLength = 10.0;
  for (int i = 0; i < 8; ++i) a.DroopGain[i] = 0.125 * i - 1e-7;
  a.Temperature = 21.5;
  SpectralWindows_Obj w;
  w.AzMatchedFilterType = "HAMMING";
  w.RgMatchedFilterType = "HAMMING";
  w.RgMatchedFilterCoef = 0.75;
  w.AzMatchedFilterCoef = 0.0;
  w.RgLookBandwidth = 15e6;
  w.AzLookBandwidth = 1200.0;
  SwathInfo sw;
  sw.Rank = 9;
  sw.Rgate_bias = 2.5e-7;
  sw.Echoes_per_burst = 10;
  sw.Lines_per_burst = 20;
  sw.Bursts = 3;
  sw.Order = 1;
  sw.Acquisition_Start_Time = 860000000.123456;
  sw.Swst_changes = 3;
  ASSERT_EQ(sw.createBuffers(), 0);
  sw.Swst_changes_bursts = {5, 17, 300};
  sw.ProcessorGain = 2.0;
  QuickLook_Obj q;
  q.QL_FirstSample = 3;
  q.QL_Samples = 100;
  q.QL_AzimuthML = 5;
  SARPulse_Obj p;
  p.PulseLength = 37.12e-6;
  p.Bandwidth = 15.55e6;
  p.PulseKRate = 4.189e11;
  p.PulseEnergy = 1.0;
  p.PulseSamplingRate = 18.96e6;
  for (GeneralSAR_Base* o : std::vector<GeneralSAR_Base*>{&s, &a, &w, &sw, &q, &p})
    ASSERT_EQ(o->writehdr(file), 0);

  SamplingConstants_Obj s2;
  SensorAttitude_Obj a2;
  SpectralWindows_Obj w2;
  SwathInfo sw2;
  QuickLook_Obj q2;
  SARPulse_Obj p2;
  for (GeneralSAR_Base* o : std::vector<GeneralSAR_Base*>{&s2, &a2, &w2, &sw2, &q2, &p2})
    ASSERT_EQ(o->readhdr(file), 0);
  EXPECT_EQ(g15(s2.frg_hz), g15(s.frg_hz));
  EXPECT_EQ(g15(s2.pri_s), g15(s.pri_s));
  EXPECT_EQ(g15(s2.lambda_m), g15(s.lambda_m));
  EXPECT_EQ(s2.brf_hz, 0.0);
  for (int i = 0; i < 8; ++i) EXPECT_EQ(g15(a2.DroopGain[i]), g15(a.DroopGain[i]));
  EXPECT_EQ(a2.Temperature, 21.5);
  EXPECT_EQ(w2.AzMatchedFilterType, "HAMMING");
  EXPECT_EQ(w2.AzLookBandwidth, 1200.0);
  EXPECT_EQ(sw2.Swst_changes, 3);
  EXPECT_EQ(sw2.Swst_changes_bursts, (std::vector<int>{5, 17, 300}));
  EXPECT_EQ(g15(sw2.Acquisition_Start_Time), g15(sw.Acquisition_Start_Time));
  EXPECT_EQ(q2.QL_Samples, 100);
  EXPECT_EQ(q2.QL_RangeML, 1);
  EXPECT_EQ(g15(p2.PulseKRate), g15(p.PulseKRate));

  // No window changes: no list is written or allocated.
  SwathInfo none;
  none.Swst_changes = -1;
  ASSERT_EQ(none.createBuffers(), 0);
  EXPECT_TRUE(none.Swst_changes_bursts.empty());
  none.writehdr(dir + "/none.hdr");
  std::ifstream text(dir + "/none.hdr");
  const std::string doc((std::istreambuf_iterator<char>(text)), std::istreambuf_iterator<char>());
  EXPECT_EQ(doc.find("Swst_changes_bursts"), std::string::npos);
  EXPECT_NE(doc.find("Swst_changes"), std::string::npos);

  // Profile forms written by hand.
  record_test::writeText(dir + "/old.hdr",
                         "\n[SamplingConstants]\nCarrierFrequency = 5300000000\nSamplingRate = 18962468\n"
                         "RangeBandWidth = 15550000\nRangeTSamplingStep = 5.27e-08\nPRF = 1679.902\n"
                         "PRI = 0.000595\nAzimuthBandwidth = 1378\nBRF = 0\nBRI = 0\n"
                         "WaveLength = 0.0565646\n"
                         "\n[Pulse]\nPulseLength = 3.712e-05\nBandwidth = 15550000\n"
                         "PulseKRate = 418900000000\nPulseEnergy = 1\nPulseSamplingRate = 18962468\n"
                         "\n[SensorAttitude]\nEq_speed = 7100\nEq_distance = 850000\nMean_DC = 12\n"
                         "SquintAngle = 0\nAntennaLength = 10\nDroopGain = {1 2 3 4 5 6 7 8}\n"
                         "Temperature = 20\n"
                         "\n[SpectralWindows]\nAzMatchedFilterType = HAMMING\n"
                         "RgMatchedFilterType = HAMMING\nRgMatchedFilterCoef = 0.75\n"
                         "AzMatchedFilterCoef = 0.75\nRgLookBandwidth = 1\nAzLookBandwidth = 1\n"
                         "\n[SwathInfo]\nRank = 9\nRgate_bias = 0\nEchoes_per_burst = 1\n"
                         "Lines_per_burst = 1\nBursts = 1\nOrder = 0\nAcquisition_Start_Time = 5\n"
                         "Swst_changes = 2\nSwst_changes_bursts = {4 8}\n");
  SamplingConstants_Obj s3;
  ASSERT_EQ(s3.readhdr(dir + "/old.hdr"), 0);
  EXPECT_EQ(s3.fc_hz, 5.3e9);
  EXPECT_EQ(s3.lambda_m, 0.0565646);
  SARPulse_Obj p3;
  ASSERT_EQ(p3.readhdr(dir + "/old.hdr"), 0);
  EXPECT_EQ(p3.PulseSamplingRate, 18962468.0);
  SensorAttitude_Obj a3;
  ASSERT_EQ(a3.readhdr(dir + "/old.hdr"), 0);
  EXPECT_EQ(a3.DroopGain[7], 8.0);
  SpectralWindows_Obj w3;
  ASSERT_EQ(w3.readhdr(dir + "/old.hdr"), 0);
  EXPECT_EQ(w3.RgMatchedFilterType, "HAMMING");
  SwathInfo sw3;
  ASSERT_EQ(sw3.readhdr(dir + "/old.hdr"), 0);
  EXPECT_EQ(sw3.Swst_changes_bursts, (std::vector<int>{4, 8}));
  EXPECT_EQ(sw3.ProcessorGain, 1.0);
  // A required key missing fails; the quick look has no profile form.
  record_test::writeText(dir + "/short.hdr", "\n[Pulse]\nPulseLength = 1\n\n[QuickLook]\nQL_Samples = 3\n");
  SARPulse_Obj p4;
  EXPECT_EQ(p4.readhdr(dir + "/short.hdr"), 1);
  QuickLook_Obj q4;
  EXPECT_EQ(q4.readhdr(dir + "/short.hdr"), 1);
}

// A fake ASA_INS / ASA_XCA product: main header, specific header with the
// data offset at position 231, then the record.
std::string fakeAsarAux(const std::string& path, const std::vector<unsigned char>& record) {
  std::string header(1247 + 378, ' ');
  const std::string offset = "+00000000000000001625<bytes>";
  header.replace(1247 + 231, offset.size(), offset);
  std::ofstream out(path, std::ios::binary);
  out.write(header.data(), static_cast<std::streamsize>(header.size()));
  out.write(reinterpret_cast<const char*>(record.data()), static_cast<std::streamsize>(record.size()));
  return path;
}

TEST(SensorAttitude, DroopGainFromInstrumentFile) {
  const std::string dir = record_test::freshDir();
  std::vector<unsigned char> rec(171648, 0);
  for (int s = 0; s < 5; ++s) {
    const std::size_t table = 171368 - 68 * static_cast<std::size_t>(4 - s);
    float2ch(20.0f + s, &rec[table], 'm');
    for (int i = 0; i < 8; ++i) {
      const double v = 100.0 * s + i + 0.5;
      unsigned char b[8];
      std::memcpy(b, &v, 8);
      if (get_endian() == 'l') swp8(b);
      std::memcpy(&rec[table + 4 + 8 * i], b, 8);
    }
  }
  const std::string ins = fakeAsarAux(dir + "/ASA_INS_AX", rec);
  SensorAttitude_Obj a;
  ASSERT_EQ(a.getDroopGain(ins, 4), 0);
  EXPECT_EQ(a.Temperature, 24.0);
  EXPECT_EQ(a.DroopGain[0], 400.5);
  EXPECT_EQ(a.DroopGain[7], 407.5);
  ASSERT_EQ(a.getDroopGain(ins, 1), 0);
  EXPECT_EQ(a.DroopGain[3], 103.5);
  EXPECT_EQ(a.Temperature, 21.0);
  // Swath 5 and above: nothing changes.
  ASSERT_EQ(a.getDroopGain(ins, 5), 0);
  EXPECT_EQ(a.DroopGain[3], 103.5);
  EXPECT_EQ(a.Temperature, 21.0);
  EXPECT_EQ(a.getDroopGain(dir + "/missing", 1), 9);
  std::ofstream(dir + "/short", std::ios::binary) << std::string(2000, ' ');
  EXPECT_EQ(a.getDroopGain(dir + "/short", 1), 4);
}

TEST(SwathInfo, BurstTimesFromRowPrefixes) {
  const std::string dir = record_test::freshDir();
  const std::string raster = dir + "/raw";
  DataFile layout(raster);
  layout.NrOfPixelsPerLine = 4;
  layout.NrOfLinesPerImage = 6;
  layout.RowPrefix = 17;
  layout.CellType = INT8_COMPLEX;
  ASSERT_EQ(layout.write_hdr(), 0);
  std::ofstream out(raster, std::ios::binary);
  const double t0 = ascii2sec85("29-MAR-2012 07:11:34.432893");
  for (int row = 0; row < 6; ++row) {
    unsigned char prefix[17] = {};
    const mjd m = sec852mjd(t0 + row * 0.5);
    std::memcpy(prefix, &m.days, 4);
    std::memcpy(prefix + 4, &m.seconds, 4);
    std::memcpy(prefix + 8, &m.microseconds, 4);
    out.write(reinterpret_cast<const char*>(prefix), 17);
    out.write("abcdefgh", 8);
  }
  out.close();
  SwathInfo s;
  s.Bursts = 3;
  s.Lines_per_burst = 2;
  ASSERT_EQ(s.readBurstTimes(raster), 0);
  ASSERT_EQ(s.BurstTimes.size(), 3u);
  EXPECT_NEAR(s.BurstTimes[0], t0, 1e-6);
  EXPECT_NEAR(s.BurstTimes[1], t0 + 1.0, 1e-6);
  EXPECT_NEAR(s.BurstTimes[2], t0 + 2.0, 1e-6);
  s.Bursts = 4;  // runs past the end
  EXPECT_EQ(s.readBurstTimes(raster), 4);
}

TEST(AntennaPattern, RealExternalCalibrationFile) {
  const std::string xca = TESSIVOR_REALDATA_DIR
      "/envisat/ASA_XCA_AXVIEC20070517_153558_20070204_165113_20071231_000000";
  if (!std::ifstream(xca)) GTEST_SKIP() << "real data folder absent";
  std::ifstream in(xca, std::ios::binary);
  std::vector<unsigned char> bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
  AntennaPattern_Obj a;
  ASSERT_EQ(a.getPatternENVI(xca, 1, 2), 0);
  EXPECT_EQ(a.PatternSamples, 201);
  ASSERT_EQ(a.Pattern.size(), 201u);
  const std::size_t entry = 1625 + 12760 + 804 * (1 + 4 * 2);
  EXPECT_FLOAT_EQ(a.Pattern[0], static_cast<float>(std::pow(10.0, ch2float4(&bytes[entry], 'm') / 20.0)));
  EXPECT_FLOAT_EQ(a.Pattern[200],
                  static_cast<float>(std::pow(10.0, ch2float4(&bytes[entry + 800], 'm') / 20.0)));
  EXPECT_NEAR(a.StartAngle, 20.138 - 5.0, 1e-3);  // boresight of swath 1
  EXPECT_EQ(a.DeltaAngle, 0.05);
  EXPECT_EQ(a.getPatternENVI(xca, 3, 4), 10);  // beyond the table
}

TEST(AntennaPattern, RasterAndHeader) {
  const std::string dir = record_test::freshDir();
  AntennaPattern_Obj a;
  a.PatternSamples = 0;
  EXPECT_EQ(a.createBuffers(), 0);
  EXPECT_TRUE(a.Pattern.empty());
  a.PatternSamples = 5;
  ASSERT_EQ(a.createBuffers(), 0);
  a.Pattern = {0.5f, 1.0f, 2.0f, 1.0f, 0.5f};
  a.StartAngle = 15.25;
  a.DeltaAngle = 0.05;
  a.patternFile.filename = dir + "/pat";
  ASSERT_EQ(a.WritePatternArray(), 0);
  ASSERT_EQ(a.writehdr(), 0);

  AntennaPattern_Obj b;
  ASSERT_EQ(b.readhdr(dir + "/pat.hdr"), 0);
  EXPECT_EQ(b.StartAngle, 15.25);
  EXPECT_EQ(b.PatternSamples, 5);
  float buf[5] = {};
  ASSERT_EQ(b.getPatternArray(buf), 0);
  EXPECT_EQ(buf[2], 2.0f);
  ASSERT_EQ(b.Pattern.size(), 5u);
  b.Pattern[2] = 7.0f;  // afterwards the array is used
  ASSERT_EQ(b.getPatternArray(buf), 0);
  EXPECT_EQ(buf[2], 7.0f);
}

TEST(DataSetInfo, EnumerationsAndHelpers) {
  DataSetInfo_Obj d;
  EXPECT_EQ(d.MissingLines, -1);
  EXPECT_TRUE(d.IsImageType(DataSetInfo_Obj::IT_NOT_SET));
  d.SetImageType(DataSetInfo_Obj::IT_RAW_DATA_ALIGNED);
  EXPECT_EQ(d.ImageType, "RAW DATA ALIGNED");
  d.SetImageType(15);
  EXPECT_EQ(d.ImageType, "NOT SET");
  d.ImageType = "SOMETHING ELSE";
  for (int i = 0; i <= 14; ++i) EXPECT_FALSE(d.IsImageType(i));
  d.SetSensorType(DataSetInfo_Obj::ST_TERRASARX);
  EXPECT_EQ(d.SensorName, "TERRA SAR-X");
  d.SetUnitType(DataSetInfo_Obj::UT_VOLT2);
  EXPECT_EQ(d.UnitType, "VOLT^2");
  d.SetUnitType(DataSetInfo_Obj::UT_VOLTCOMPLEX);
  EXPECT_TRUE(d.IsUnitType(3));

  d.RefSystem = "KEEP";
  d.SetType(DataSetInfo_Obj::IT_AZIMUTH_FOCUSED, DataSetInfo_Obj::ST_ASAR,
            DataSetInfo_Obj::AM_STRIPMAP, DataSetInfo_Obj::PR_SLANT_RANGE,
            DataSetInfo_Obj::UT_VOLTCOMPLEX, DataSetInfo_Obj::RS_WGS84);
  EXPECT_EQ(d.RefSystem, "KEEP");
  EXPECT_EQ(d.Projection, "SLANT RANGE");
  EXPECT_EQ(d.AcquisitionMode, "STRIPMAP");
  EXPECT_FALSE(d.IsType(2, 1, 1, 2, 3, 1));
  d.SetType(2, 1, 1, DataSetInfo_Obj::PR_GEOCODED, 3, DataSetInfo_Obj::RS_EGM84);
  EXPECT_EQ(d.RefSystem, "EGM84");
  EXPECT_TRUE(d.IsType(2, 1, 1, 3, 3, 2));

  d.fillORVANE();
  EXPECT_EQ(d.ProcessingCenter, "ORVANE Lumbra");
  const char* pols[] = {"H/H", "H/V", "V/H", "V/V", "HH"};
  const int polNbr[] = {0, 1, 2, 3, 666};
  for (int i = 0; i < 5; ++i) {
    d.Polarization = pols[i];
    EXPECT_EQ(d.getPolarizationNbr(), polNbr[i]);
  }
  const char* swaths[] = {"SS1", "SS2", "SS5", "IS1", "IS2", "IS7", "IS8", "NOT_AVAILABLE"};
  const int swNbr[] = {7, 2, 5, 0, 1, 6, 666, 666};
  for (int i = 0; i < 8; ++i) {
    d.Swath = swaths[i];
    EXPECT_EQ(d.getISNbr(), swNbr[i]);
  }
  // The calibration factor follows the five bandwidths directly.
  EXPECT_EQ(reinterpret_cast<const char*>(&d.ExternalCalibrationFactor),
            reinterpret_cast<const char*>(&d.RangeBandwidth[5]));

  DataSetInfo_Obj e;
  d.clone(&e);
  EXPECT_EQ(e.Swath, d.Swath);
  EXPECT_EQ(e.RefSystem, "EGM84");
}

TEST(DataSetInfo, ProfileFormGroups) {
  const std::string dir = record_test::freshDir();
  const std::string group1 =
      "\n[DataSetInfo]\nOrbitNumber = 44928\nTrack = 12\nSenseDate = 17-FEB-2000 09:57:26.417000\n"
      "SceneID = x\nDescription = d\nAcquisitionStation = I-PAF\nProcessingCenter = c\n"
      "ProcessingDate = p\nProcessingSoftware = s\nSceneHeading = 194.302\n"
      "OrbitConfiguration = DESCENDING\nPolarization = V/V\nSwath = NOT_AVAILABLE\n"
      "SWST_MIN = 0.0055\nSWST_MAX = 0.0056\nRO_REF = 850000\nRangeLooks = 1\n"
      "RangeBandwidth = {15550000 0 0 0 0}\nExternalCalibrationFactor = 1\n"
      "Projection = SLANT RANGE\n";
  record_test::writeText(dir + "/g1.hdr", group1);
  DataSetInfo_Obj d;
  ASSERT_EQ(d.readhdr(dir + "/g1.hdr"), 0);
  EXPECT_EQ(d.SenseDate, "17-FEB-2000 09:57:26.417000");
  EXPECT_EQ(d.RangeBandwidth[0], 15550000.0);
  EXPECT_EQ(d.ImageType, "NOT SET");  // second group absent
  EXPECT_EQ(d.MissingLines, -1);
  record_test::writeText(dir + "/g2.hdr", group1 + "ImageType = RAW DATA\nMissingLines = 4\n"
                                                   "LookDirection = 7\nDroopGain_flag = 1\n");
  DataSetInfo_Obj e;
  ASSERT_EQ(e.readhdr(dir + "/g2.hdr"), 0);
  EXPECT_TRUE(e.IsImageType(DataSetInfo_Obj::IT_RAW_DATA));
  EXPECT_EQ(e.MissingLines, 4);
  EXPECT_EQ(e.DroopGain_flag, 1);
  EXPECT_EQ(e.LookDirection, 0);  // element document only
  record_test::writeText(dir + "/bad.hdr", "\n[DataSetInfo]\nOrbitNumber = 1\n");
  DataSetInfo_Obj f;
  EXPECT_EQ(f.readhdr(dir + "/bad.hdr"), 1);
}

TEST(GeoCoords, ElementAndProfileForms) {
  const std::string dir = record_test::freshDir();
  geoCoords_Obj g;
  g.NW.set(45.1, 10.2, 0.0, 23.5, 20.25);
  g.NE.set(45.2, 11.2, 0.0, 26.5, 23.25);
  g.SW.set(44.1, 10.0, 0.0, 23.4, 20.2);
  g.SE.set(44.2, 11.0, 0.0, 26.4, 23.2);
  g.center.set(44.65, 10.6, 0.0, 24.9, 21.7);
  g.EastingGridSize = 20.0;
  g.NorthingGridSize = 4.0;
  ASSERT_EQ(g.writehdr(dir + "/g.hdr"), 0);
  geoCoords_Obj h;
  ASSERT_EQ(h.readhdr(dir + "/g.hdr"), 0);
  EXPECT_EQ(h.NE.lon, 11.2);
  EXPECT_EQ(h.center.incidence, 24.9);
  EXPECT_EQ(h.SW.Point[4], 20.2);
  EXPECT_EQ(h.NorthingGridSize, 4.0);

  record_test::writeText(dir + "/old.hdr",
                         "\n[GeoGridSize]\nEastingGridSize = 12.5\nNorthingGridSize = 4\n"
                         "\n[Coordinates]\nNorthEast = {45 11 0 26 23}\n");
  geoCoords_Obj o;
  ASSERT_EQ(o.readhdr(dir + "/old.hdr"), 0);
  EXPECT_EQ(o.EastingGridSize, 12.5);
  EXPECT_EQ(o.NE.incidence, 26.0);
  EXPECT_EQ(o.NW.lat, -999.0);
  EXPECT_EQ(o.center.Point[3], -999.0);
  record_test::writeText(dir + "/none.hdr", "\n[Other]\nx = 1\n");
  geoCoords_Obj n;
  EXPECT_EQ(n.readhdr(dir + "/none.hdr"), 1);
  EXPECT_EQ(n.SE.lon, -999.0);
}

}  // namespace
