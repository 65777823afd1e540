// Export of a filled product record into the description headers and back.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdlib>
#include <filesystem>
#include <string>

#include "base/constants.h"
#include "base/status.h"
#include "output/description_text.h"
#include "output/description_xml.h"
#include "output/general_sar_kelmir.h"
#include "output_test_util.h"
#include "product/time_base.h"

using namespace output_test;

namespace {

constexpr double kT0 = 700000000.0;  // first state vector, seconds since 1985
constexpr double kPrf = 1679.902;
constexpr double kFs = 18.96e6;
constexpr double kNear = 5.5e-3;
constexpr int kSamples = 2048;
constexpr int kLines = 3000;
const std::string kStation = "Kiruna & <Fucino> \"K\" 'F'";

// Earth-fixed position on a circular sun-synchronous-like orbit, t seconds
// after kT0.
void circularPosition(double t, double p[3]) {
  const double radius = 6378137.0 + 785000.0, mu = 3.986004418e14;
  const double u = 0.3 + std::sqrt(mu / (radius * radius * radius)) * t;
  const double inc = 98.5 * consts::kPi / 180.0, node = 1.1 - consts::kEarthRotation * t;
  const double x = std::cos(u), y = std::sin(u) * std::cos(inc);
  p[0] = radius * (x * std::cos(node) - y * std::sin(node));
  p[1] = radius * (x * std::sin(node) + y * std::cos(node));
  p[2] = radius * std::sin(u) * std::sin(inc);
}

void fillOrbit(GeneralSAROrbit& orbit) {
  ASSERT_EQ(orbit.SVCreate(kT0, 10.0, 12), 0);
  for (int i = 0; i < 12; ++i) {
    double a[3], b[3];
    circularPosition(i * 10.0, &orbit.pos[3 * i]);
    circularPosition(i * 10.0 - 1e-3, a);
    circularPosition(i * 10.0 + 1e-3, b);
    for (int k = 0; k < 3; ++k) orbit.vel[3 * i + k] = (b[k] - a[k]) / 2e-3;
  }
  ASSERT_EQ(orbit.computeApproximateSV(), 0);
}

void fillRecord(GeneralSAR_kelmir& r, bool withOrbit) {
  r.dataFile.NrOfPixelsPerLine = kSamples;
  r.dataFile.NrOfLinesPerImage = kLines;
  r.dataFile.RowPrefix = 4;
  r.dataFile.HeaderOffset = 720;
  r.dataFile.CellType = FLOAT_COMPLEX;
  r.dataFile.ByteOrder = 1;
  r.roi.roi.SetFastAxe(kNear, 1.0 / kFs, kSamples);
  r.roi.roi.SetSlowAxe(kT0 + 40.125, 1.0 / kPrf, kLines);
  r.sampling.fc_hz = 5.3e9;
  r.sampling.prf_hz = kPrf;
  r.sampling.frg_hz = kFs;
  r.sampling.Brg_hz = 15.55e6;
  r.sampling.bri_s = std::nan("");
  r.pulse.PulseLength = 37.12e-6;
  r.dataSetInfo.AcquisitionStation = kStation;
  r.dataSetInfo.ProcessingCenter = "";
  r.dataSetInfo.ProcessingDate = "23-NOV-2026 11:00:00.000000";
  r.dataSetInfo.OrbitNumber = "12345";
  r.dataSetInfo.SensorName = "ERS2";
  r.dataSetInfo.SceneHeading = -166.25;
  r.dataSetInfo.OrbitConfiguration = "DESCENDING";
  r.dataSetInfo.ExternalCalibrationFactor = 0.5;
  r.dataSetInfo.UnitType = "VOLT COMPLEX";
  r.attitude.Eq_speed = 7100.5;
  ASSERT_EQ(r.polynomials.CreatePolys(2, 1), 0);
  for (int i = 0; i < 2; ++i) {
    r.polynomials.DC[i].taz0 = kT0 + 40.0 + 2.5 * i;
    r.polynomials.DC[i].trg0 = kNear;
    for (int k = 0; k < 7; ++k) r.polynomials.DC[i].c[k] = (k + 1) * 0.125 * (i + 1);
  }
  r.polynomials.FR[0].taz0 = kT0 + 41.0;
  r.polynomials.FR[0].trg0 = kNear + 1e-5;
  r.polynomials.FR[0].c[0] = -2210.5;
  r.polynomials.FR[0].c[1] = 1.0 / 3.0;
  double lat = 45.0, lon = 12.0;
  for (geopoint* p : {&r.geoCoords.NW, &r.geoCoords.NE, &r.geoCoords.SE, &r.geoCoords.SW, &r.geoCoords.center}) {
    p->set(lat, lon, 0.0, 21.5, 19.25);
    lat += 0.25;
    lon -= 0.125;
  }
  for (auto object : {GeneralSAR::GS_DATAFILE, GeneralSAR::GS_ROI, GeneralSAR::GS_POLYNOMIALS,
                      GeneralSAR::GS_SAMPLING, GeneralSAR::GS_PULSE, GeneralSAR::GS_DATASETINFO,
                      GeneralSAR::GS_ATTITUDE, GeneralSAR::GS_GEOCOORDS})
    r.GSenable(object);
  if (withOrbit) {
    r.GSenable(GeneralSAR::GS_ORBIT);
    fillOrbit(r.orbit());
  }
}

// Every exported value of the record read back from the headers.
void expectSameExport(GeneralSAR_kelmir& a, GeneralSAR_kelmir& b) {
  EXPECT_EQ(b.dataFile.NrOfPixelsPerLine, kSamples);
  EXPECT_EQ(b.dataFile.NrOfLinesPerImage, kLines);
  EXPECT_EQ(b.dataFile.RowPrefix, 4);
  EXPECT_EQ(b.dataFile.HeaderOffset, 720);
  EXPECT_EQ(b.dataFile.CellType, FLOAT_COMPLEX);
  EXPECT_EQ(b.dataFile.ByteOrder, 1);
  EXPECT_EQ(b.roi.roi.FastStartTime, kNear);
  EXPECT_DOUBLE_EQ(b.roi.roi.FastTimeDelta, 1.0 / kFs);
  EXPECT_NEAR(b.roi.roi.SlowStartTime, a.roi.roi.SlowStartTime, 1e-6);
  EXPECT_DOUBLE_EQ(b.roi.roi.SlowTimeDelta, 1.0 / kPrf);
  EXPECT_EQ(b.roi.roi.Samples, kSamples);
  EXPECT_EQ(b.roi.roi.Lines, kLines);
  EXPECT_EQ(b.sampling.fc_hz, 5.3e9);
  EXPECT_EQ(b.sampling.prf_hz, kPrf);
  EXPECT_EQ(b.sampling.frg_hz, kFs);
  EXPECT_EQ(b.sampling.Brg_hz, 15.55e6);
  EXPECT_TRUE(std::isnan(b.sampling.bri_s));
  EXPECT_EQ(b.pulse.PulseLength, 37.12e-6);
  EXPECT_EQ(b.dataSetInfo.AcquisitionStation, kStation);
  EXPECT_EQ(b.dataSetInfo.ProcessingCenter, "");
  EXPECT_EQ(b.dataSetInfo.ProcessingDate, "23-NOV-2026 11:00:00.000000");
  EXPECT_EQ(b.dataSetInfo.OrbitNumber, "12345");
  EXPECT_EQ(b.dataSetInfo.SensorName, "ERS2");
  EXPECT_EQ(b.dataSetInfo.SceneHeading, -166.25);
  EXPECT_EQ(b.dataSetInfo.OrbitConfiguration, "DESCENDING");
  EXPECT_EQ(b.dataSetInfo.ExternalCalibrationFactor, 0.5);
  EXPECT_EQ(b.dataSetInfo.Description, "ERS2_IM");
  EXPECT_EQ(b.dataSetInfo.RangeLooks, 1);
  EXPECT_EQ(b.attitude.Eq_speed, 7100.5);
  ASSERT_EQ(b.polynomials.DC.size(), 2u);
  ASSERT_EQ(b.polynomials.FR.size(), 1u);
  for (int i = 0; i < 2; ++i) {
    EXPECT_NEAR(b.polynomials.DC[i].taz0, a.polynomials.DC[i].taz0, 1e-6);
    EXPECT_EQ(b.polynomials.DC[i].trg0, kNear);
    for (int k = 0; k < 7; ++k) EXPECT_EQ(b.polynomials.DC[i].c[k], a.polynomials.DC[i].c[k]);
  }
  EXPECT_EQ(b.polynomials.FR[0].c[1], 1.0 / 3.0);
  EXPECT_EQ(b.polynomials.FR[0].trg0, kNear + 1e-5);
  ASSERT_TRUE(b.GSexists(GeneralSAR::GS_ORBIT));
  EXPECT_EQ(b.orbit().nSV, 12);
  EXPECT_NEAR(b.orbit().t0, kT0, 1e-6);
  EXPECT_EQ(b.orbit().dt, 10.0);
  EXPECT_EQ(b.orbit().pos, a.orbit().pos);
  EXPECT_EQ(b.orbit().vel, a.orbit().vel);
  EXPECT_EQ(b.geoCoords.NW.lat, 45.0);
  EXPECT_EQ(b.geoCoords.NE.lon, 11.875);
  EXPECT_EQ(b.geoCoords.SE.lat, 45.5);
  EXPECT_EQ(b.geoCoords.SW.lon, 11.625);
  EXPECT_EQ(b.geoCoords.center.lat, 46.0);
  EXPECT_EQ(b.geoCoords.center.incidence, 21.5);
  EXPECT_EQ(b.geoCoords.center.look, 19.25);
  EXPECT_EQ(b.otherInfo.SuggestedAzimuthLooks, a.otherInfo.SuggestedAzimuthLooks);
  EXPECT_EQ(b.otherInfo.PixelSpacingAz, a.otherInfo.PixelSpacingAz);
  EXPECT_EQ(b.otherInfo.RangeGroundPixelSpaceFromSuggestLooks,
            a.otherInfo.RangeGroundPixelSpaceFromSuggestLooks);
}

}  // namespace

TEST(GeneralSARKelmir, ExportReadsBackFromBothSpellings) {
  const std::string dir = support::scratchDir("output");
  const std::string product = dir + "scene_slc";
  GeneralSAR_kelmir record;
  fillRecord(record, true);
  ASSERT_EQ(record.writehdr_kelmir(product, "", 6900.0f, KT_ERS2), 0);
  ASSERT_TRUE(std::filesystem::exists(product + ".sml"));
  ASSERT_TRUE(std::filesystem::exists(product + "_hdr"));
  EXPECT_EQ(validateAgainstSchema(product + ".sml"), 0);
  if (std::filesystem::exists("/usr/bin/xmllint")) {
    const std::string command = "xmllint --noout --schema '" + schemaPath() + "' '" + product +
                                ".sml' > /dev/null 2>&1";
    EXPECT_EQ(std::system(command.c_str()), 0);
  }

  // Sections and fixed texts of the export.
  const auto& h = record.header();
  std::string s;
  EXPECT_EQ(h.getField("RasterInfo.CellType")->getString(s), 0);
  EXPECT_EQ(s, "FLOAT_COMPLEX");
  EXPECT_EQ(h.getField("RasterInfo.BytesOrder")->strings.at(0), "MSBF");
  EXPECT_EQ(h.getField("RasterInfo.DataUnits")->strings.at(0), "VOLT COMPLEX");
  EXPECT_EQ(h.getField("RasterInfo.SOFTWARE")->strings.at(0), tesv_program_name());
  EXPECT_EQ(h.getField("InitialGeometry.Projection")->strings.at(0), "SLANT_RANGE");
  EXPECT_EQ(h.getField("InitialGeometry.TimeDirectionPixel")->strings.at(0), "INCREASE TIME DIRECTION");
  EXPECT_EQ(h.getField("InitialGeometry.TimeDirectionLines")->strings.at(0), "INCREASE TIME DIRECTION");
  EXPECT_EQ(h.getField("InitialGeometry.SceneHeading")->doubles.at(0), -166.25);
  EXPECT_EQ(h.getField("Processing.StateVectorSource")->strings.at(0), "SLC_DATA_PRODUCT");
  EXPECT_EQ(h.getField("RegistrationCoordinates.Units")->strings.at(0), "DEGREES");
  EXPECT_EQ(h.getField("CartographicSystem.UTM_HEMISPHERE")->strings.at(0), "NORTH");
  EXPECT_EQ(h.getField("CartographicSystem.UTM_ZONE")->ints.at(0), 32);
  EXPECT_EQ(h.getField("CartographicSystem.CORNER POINT 2  X")->doubles.at(0), 11.875);
  EXPECT_EQ(h.getField("InitialGeometry.SlantRange")->doubles.at(0), kNear * consts::kSpeedOfLight / 2);
  EXPECT_TRUE(h.getField("InitialGeometry.SlantRange")->mandatory);
  EXPECT_TRUE(h.getField("Sensor.PulseDuration")->mandatory);
  EXPECT_FALSE(h.getField("Sensor.Inter_Burst_Time")->mandatory);
  std::string start;
  sec852ascii(kT0 + 40.125, start);
  EXPECT_EQ(h.getField("InitialGeometry.AzimuthStartTime")->strings.at(0), start);
  EXPECT_EQ(h.getField("sar_processing.DopCenRangeCoeff")->rows, 2);
  EXPECT_EQ(h.getField("sar_processing.DopCenRangeCoeff")->cols, 7);
  EXPECT_EQ(h.getField("sar_processing.ProcessingVelocity")->doubles.at(0), 7100.5);
  EXPECT_EQ(h.getField("sar_processing.PixelSpacingAz")->doubles.at(0), 7100.5 / kPrf);

  // Derived values: ERS geometry gives ground range pixels five to six times
  // the azimuth spacing.
  const OtherInfo_kelmir& info = record.otherInfo;
  GeneralSAROrbit probe;
  ASSERT_EQ(record.orbit().clone(&probe), 0);
  double tc = kT0 + 40.125 + kLines / kPrf / 2, tau = kNear + kSamples / kFs / 2;
  double inc = 0, look = 0, ground = 0;
  ASSERT_EQ(probe.SVGetAngles(tc, tau, &inc, &look), 0);
  ASSERT_EQ(probe.SVGetSatSpeed(tc, tau, 0.0, &ground), 0);
  EXPECT_GT(inc, 18.0);
  EXPECT_LT(inc, 26.0);
  const double slant = consts::kSpeedOfLight / 2 / kFs;
  EXPECT_NEAR(info.GroundPixelSpacingRg, slant / std::sin(inc * consts::kPi / 180), 1e-9);
  EXPECT_NEAR(info.PixelSpacingAz, ground / kPrf, 1e-12);
  EXPECT_GT(info.PixelSpacingAz, 3.6);
  EXPECT_LT(info.PixelSpacingAz, 4.3);
  const int looks = static_cast<int>(std::lround(info.GroundPixelSpacingRg / info.PixelSpacingAz));
  EXPECT_GE(looks, 5);
  EXPECT_LE(looks, 6);
  EXPECT_EQ(info.SuggestedAzimuthLooks, looks);
  EXPECT_EQ(info.SuggestedRangeLooks, 1);
  EXPECT_DOUBLE_EQ(info.AzimuthGroundPixelSpaceFromSuggestLooks, looks * info.PixelSpacingAz);
  EXPECT_DOUBLE_EQ(info.RangeGroundPixelSpaceFromSuggestLooks, info.GroundPixelSpacingRg);

  GeneralSAR_kelmir fromXml;
  ASSERT_EQ(fromXml.readhdr_kelmir(product), 0);
  expectSameExport(record, fromXml);

  std::filesystem::remove(product + ".sml");
  GeneralSAR_kelmir fromText;
  ASSERT_EQ(fromText.readhdr_kelmir(product), 0);
  expectSameExport(record, fromText);
}

TEST(GeneralSARKelmir, FallbacksWithoutOrbitOrSpeed) {
  const std::string dir = support::scratchDir("output");
  GeneralSAR_kelmir record;
  fillRecord(record, false);
  record.attitude.Eq_speed = -999.0;
  record.roi.roi.SetSlowAxe(kT0, -1.0 / kPrf, kLines);
  ASSERT_EQ(record.writehdr_kelmir(dir + "p", "", 6900.0f, KT_RADARSAT), 0);
  const auto& h = record.header();
  EXPECT_EQ(h.getField("sar_processing.ProcessingVelocity")->doubles.at(0), 6900.0);
  EXPECT_EQ(h.getField("RasterInfo.Description")->strings.at(0), "RS1_IM");
  EXPECT_EQ(h.getField("InitialGeometry.TimeDirectionLines")->strings.at(0), "DECREASE TIME DIRECTION");
  EXPECT_EQ(h.getField("StateVectorData.nStateVectors"), nullptr);
  // Geometry from the centre incidence of the corners and the given speed.
  EXPECT_DOUBLE_EQ(record.otherInfo.PixelSpacingAz, 6900.0 / kPrf);
  EXPECT_DOUBLE_EQ(record.otherInfo.GroundPixelSpacingRg,
                   consts::kSpeedOfLight / 2 / kFs / std::sin(21.5 * consts::kPi / 180));

  EXPECT_STREQ(kelmirProductIdentifier(KT_ENVISAT_IM), "ENVISAT_IM0");
  EXPECT_STREQ(kelmirProductIdentifier(KT_ENVISAT_AP), "ENVISAT_AP0");
  EXPECT_STREQ(kelmirProductIdentifier(KT_PALSAR_QUAD), "ALOS_PALSAR_PLR10");
  EXPECT_STREQ(kelmirProductIdentifier(KT_PALSAR_ERSDAC), "ALOS_PALSAR");
  EXPECT_STREQ(kelmirProductIdentifier(42), "");
}

TEST(GeneralSARKelmir, RewriteKeepsWhatItDoesNotWrite) {
  const std::string dir = support::scratchDir("output");
  const std::string product = dir + "p";
  GeneralSAR_kelmir record;
  fillRecord(record, false);
  ASSERT_EQ(record.writehdr_kelmir(product, "", 6900.0f, KT_ERS1), 0);

  // Someone else adds a section and a field to the XML header and a
  // section to the text header.
  tesv_description_section tree;
  ASSERT_EQ(tesv_read_description_xml(product + ".sml", tree), 0);
  tree.openSection("Interferometry").setField("Coherence").setDouble(0.75);
  tree.setField("RasterInfo.NrOfChannels").setInt(1);
  ASSERT_EQ(tesv_write_description_xml(tree, product + ".sml"), 0);
  std::string text = readText(product + "_hdr");
  writeText(product + "_hdr", text + "[GeoTiffExtras]\nTiffScale = 2.5\n");

  record.dataFile.NrOfLinesPerImage = 10;
  ASSERT_EQ(record.writehdr_kelmir(product, "", 6900.0f, KT_ERS1), 0);
  ASSERT_EQ(tesv_read_description_xml(product + ".sml", tree), 0);
  EXPECT_EQ(tree.getField("Interferometry.Coherence")->doubles.at(0), 0.75);
  EXPECT_EQ(tree.getField("RasterInfo.NrOfChannels")->ints.at(0), 1);
  EXPECT_EQ(tree.getField("RasterInfo.NrOfLinesPerImage")->ints.at(0), 10);
  EXPECT_EQ(tree.getField("RasterInfo.Description")->strings.at(0), "ERS1_IM");
  ASSERT_EQ(tesv_read_description_text(product + "_hdr", tree), 0);
  EXPECT_EQ(tree.getField("GeoTiffExtras.TiffScale")->doubles.at(0), 2.5);
  EXPECT_EQ(tree.getField("Interferometry.Coherence")->doubles.at(0), 0.75);
  EXPECT_EQ(tree.getField("RasterInfo.NrOfLinesPerImage")->ints.at(0), 10);
  EXPECT_EQ(validateAgainstSchema(product + ".sml"), 0);
}

TEST(GeneralSARKelmir, RefusalsMandatoryFieldsAndTypeReports) {
  const std::string dir = support::scratchDir("output");
  const std::string product = dir + "p";
  GeneralSAR_kelmir record;
  fillRecord(record, false);
  EXPECT_EQ(record.writehdr_kelmir(product, "", 6900.0f, KT_PALSAR_ERSDAC), STATUS_BAD_CONDITION);
  EXPECT_EQ(record.writehdr_ersdac_kelmir(product, dir + "leader", 6900.0f, KT_ERS2),
            STATUS_BAD_CONDITION);
  EXPECT_EQ(record.writehdr_ersdac_kelmir(product, dir + "leader", 6900.0f, KT_PALSAR_ERSDAC),
            STATUS_NOT_OPENED);
  EXPECT_FALSE(std::filesystem::exists(product + ".sml"));
  // An ENVISAT export whose calibration file cannot be read stops there.
  EXPECT_EQ(record.writehdr_kelmir(product, dir + "no_xca", 6900.0f, KT_ENVISAT_IM), STATUS_NOT_OPENED);
  EXPECT_FALSE(std::filesystem::exists(product + ".sml"));
  writeText(dir + "leader", std::string(4900, ' '));
  EXPECT_EQ(record.writehdr_ersdac_kelmir(product, dir + "leader", 6900.0f, KT_PALSAR_ERSDAC),
            STATUS_READ_FAILED);

  // State-vector start and step from the leader's position record.
  std::string leader(4816 + 400, ' ');
  leader.replace(4816 + 144, 4, "2007");
  leader.replace(4816 + 148, 4, "   3");
  leader.replace(4816 + 152, 4, "  15");
  leader.replace(4816 + 160, 22, "      36000.5000000000");
  leader.replace(4816 + 182, 22, "         60.0000000000");
  writeText(dir + "leader", leader);
  record.GSenable(GeneralSAR::GS_ORBIT);
  fillOrbit(record.orbit());
  ASSERT_EQ(record.writehdr_ersdac_kelmir(product, dir + "leader", 6900.0f, KT_PALSAR_ERSDAC), 0);
  EXPECT_EQ(record.header().getField("StateVectorData.TimeDelta")->doubles.at(0), 60.0);
  EXPECT_EQ(record.header().getField("StateVectorData.TimeFirst")->strings.at(0),
            "15-MAR-2007 10:00:00.500000");
  EXPECT_EQ(record.header().getField("RasterInfo.Description")->strings.at(0), "ALOS_PALSAR");

  // A header without a mandatory field is refused.
  tesv_description_section tree;
  ASSERT_EQ(tesv_read_description_xml(product + ".sml", tree), 0);
  auto& sensor = *tree.findSection("Sensor");
  for (auto it = sensor.fields.begin(); it != sensor.fields.end(); ++it)
    if (it->name == "PRFExtracted") {
      sensor.fields.erase(it);
      break;
    }
  ASSERT_EQ(tesv_write_description_xml(tree, product + ".sml"), 0);
  GeneralSAR_kelmir back;
  EXPECT_EQ(back.readhdr_kelmir(product), STATUS_BAD_PARAMETER);
  EXPECT_EQ(back.readhdr_kelmir(dir + "absent"), STATUS_NOT_OPENED);

  // A field of the wrong type is reported with its type number.
  tesv_description_section header = makeProductHeader();
  header.setField("RasterInfo.NrOfPixelsPerLine").setString("many");
  DataFile_kelmir layout;
  layout.NrOfPixelsPerLine = 7;
  EXPECT_EQ(layout.readhdr_kelmir(header), 0);
  EXPECT_EQ(layout.NrOfPixelsPerLine, 7);
  bool reported = false;
  for (const auto& e : layout.serviceReport())
    if (e.key == "report_DataFile_kelmir/result/NrOfPixelsPerLine" && e.text == "Data Type ID : 3 String" &&
        e.level == "ERROR")
      reported = true;
  EXPECT_TRUE(reported);
  EXPECT_EQ(layout.serviceReport().front().text, "initialized");
}
