// Final names, parameter stores, description headers and GeoTIFF requests of
// finished jobs, on products made in a temporary folder.
#include <gtest/gtest.h>

#include <filesystem>
#include <string>
#include <vector>

#include "job/focuser_handover.h"
#include "support/files.h"
#include "support/host_run.h"
#include "output/description_xml.h"
#include "output/general_sar_kelmir.h"
#include "output/raster_to_geotiff.h"
#include "product/general_sar.h"

using namespace support;

namespace {

class FinishedFocuser : public JobFocuser {
 public:
  int checkpar() override { return 0; }
  int InitProcessing() override { return 0; }
  int run() override { return 0; }
  int FinalizeProcessing(const char*, int) override { return 0; }
};

// A focused raster `name` with its record "<name>.hdr".
void makeProduct(const std::string& name, int samples, const std::string& polarisation = "H/H") {
  writeText(name, std::string(static_cast<std::size_t>(samples) * 8 * 2, '\1'));
  GeneralSAR record;
  record.dataFile.filename = name;
  record.dataFile.NrOfPixelsPerLine = samples;
  record.dataFile.NrOfLinesPerImage = 2;
  record.roi.roi.SetFastAxe(5.5e-3, 1.0 / 18.96e6, samples);
  record.roi.roi.SetSlowAxe(700000000.0, 1.0 / 1679.9, 2);
  record.sampling.fc_hz = 5.3e9;
  record.sampling.prf_hz = 1679.9;
  record.sampling.frg_hz = 18.96e6;
  record.sampling.Brg_hz = 15.55e6;
  record.pulse.PulseLength = 37.12e-6;
  record.dataSetInfo.Polarization = polarisation;
  record.dataSetInfo.SensorName = "TEST";
  for (auto object : {GeneralSAR::GS_DATAFILE, GeneralSAR::GS_ROI, GeneralSAR::GS_SAMPLING,
                      GeneralSAR::GS_PULSE, GeneralSAR::GS_DATASETINFO})
    record.GSenable(object);
  ASSERT_EQ(record.GSwrite(name + ".hdr"), 0);
}

// The exported header of a product, read back.
std::string description(const std::string& product) {
  tesv_description_section tree;
  if (tesv_read_description_xml(product + ".sml", tree) != 0) return "unreadable";
  std::string text;
  const auto* field = tree.getField("RasterInfo.Description");
  return field && field->getString(text) == 0 ? text : "absent";
}

int exportedSamples(const std::string& product) {
  GeneralSAR_kelmir record;
  if (record.readhdr_kelmir(product) != 0) return -1;
  return record.dataFile.NrOfPixelsPerLine;
}

// PALSAR image file whose polarisation bytes (transmit, receive) are given.
void palsarImage(const std::string& name, char transmit, char receive) {
  std::string bytes(800, ' ');
  bytes[773] = transmit;
  bytes[775] = receive;
  writeText(name, bytes);
}

}  // namespace

TEST(ProductFinishing, SingleFileProduct) {
  const std::string dir = scratchDir("finish");
  const std::string out = dir + "out";
  makeProduct(out, 16);
  const std::string originalRecord = readText(out + ".hdr");
  FinishedFocuser focuser;
  focuser.job.outputFilename = out;
  auto p = basicJob("ERS", dir + "scene", "/tmp/out");
  p[5] = out;
  p[20] = "3";
  p[21] = "4";
  p[22] = "OK";
  p[23] = "2.5";
  tesv_clear_geotiff_requests();
  finishJobProducts(focuser, p, 0);

  EXPECT_FALSE(fs::exists(out));
  EXPECT_FALSE(fs::exists(out + ".hdr"));
  EXPECT_EQ(fs::file_size(out + "_slc"), 16u * 16u);
  EXPECT_EQ(readText(out + "_slc.TessivorParameterExtracted"), originalRecord);
  EXPECT_TRUE(fs::exists(out + "_slc_hdr"));
  EXPECT_EQ(description(out + "_slc"), "ERS2_IM");
  EXPECT_EQ(exportedSamples(out + "_slc"), 16);

  const auto& requests = tesv_geotiff_requests();
  ASSERT_EQ(requests.size(), 1u);
  EXPECT_EQ(requests[0].source, out + "_slc");
  EXPECT_EQ(requests[0].output, out + "_slc.tif");
  EXPECT_EQ(requests[0].real, 2.5);
  EXPECT_EQ(requests[0].integer1, 3);
  EXPECT_EQ(requests[0].integer2, 4);
  EXPECT_EQ(requests[0].reals[0], 1.0);
  EXPECT_EQ(requests[0].maxByte, 254);
  EXPECT_EQ(requests[0].sampleLimit, 1000000);
  EXPECT_EQ(requests[0].unset[3], -1);
  EXPECT_EQ(requests[0].last, 0);

  // Without "OK" in parameter 22 there is no GeoTIFF; RADARSAT gets its tag.
  makeProduct(out, 8);
  p[0] = "RADARSAT";
  p[22] = "NotOK";
  tesv_clear_geotiff_requests();
  finishJobProducts(focuser, p, 0);
  EXPECT_TRUE(tesv_geotiff_requests().empty());
  EXPECT_EQ(description(out + "_slc"), "RS1_IM");
  EXPECT_EQ(exportedSamples(out + "_slc"), 8);
}

TEST(ProductFinishing, AlternatingPolarisationChannels) {
  const std::string dir = scratchDir("finish");
  const std::string out = dir + "ap";
  makeProduct(out + "1", 4);
  makeProduct(out + "1_descallop", 12, "V/V");
  makeProduct(out + "2_descallop", 20, "H/V");  // the undescalloped channel 2 is missing
  FinishedFocuser focuser;
  focuser.job.outputFilename = out;
  auto p = basicJob("ENVISAT", dir + "scene", "/tmp/out");
  p[5] = out;
  p[22] = "OK";
  tesv_clear_geotiff_requests();
  finishJobProducts(focuser, p, 1);

  EXPECT_FALSE(fs::exists(out + "1"));
  EXPECT_FALSE(fs::exists(out + "1.hdr"));
  EXPECT_FALSE(fs::exists(out + "1_descallop"));
  EXPECT_FALSE(fs::exists(out + "2_descallop.hdr"));
  EXPECT_EQ(fs::file_size(out + "_vv_slc"), 12u * 16u);
  EXPECT_EQ(fs::file_size(out + "_hv_slc"), 20u * 16u);
  EXPECT_TRUE(fs::exists(out + "_vv_slc.TessivorParameterExtracted"));
  EXPECT_TRUE(fs::exists(out + "_hv_slc.TessivorParameterExtracted"));
  EXPECT_EQ(description(out + "_vv_slc"), "ENVISAT_AP0");
  EXPECT_EQ(exportedSamples(out + "_hv_slc"), 20);
  const auto& requests = tesv_geotiff_requests();
  ASSERT_EQ(requests.size(), 2u);
  EXPECT_EQ(requests[0].source, out + "_vv_slc");
  EXPECT_EQ(requests[1].source, out + "_hv_slc");

  // An unknown polarisation text gives the label "1".
  makeProduct(out + "1_descallop", 4, "NOT_AVAILABLE");
  makeProduct(out + "2_descallop", 4, "H/H");
  p[22] = "NotOK";
  finishJobProducts(focuser, p, 1);
  EXPECT_TRUE(fs::exists(out + "_1_slc"));
  EXPECT_TRUE(fs::exists(out + "_hh_slc_hdr"));
}

TEST(ProductFinishing, MultiFilePalsarProducts) {
  const std::string dir = scratchDir("finish");
  const std::string out = dir + "pal";
  std::string leader(3000, ' ');
  leader.replace(1108, 4, "   4");  // quad polarisation
  writeText(dir + "LED", leader);
  palsarImage(dir + "IMG-HH", 0, 0);
  palsarImage(dir + "IMG-VV", 1, 1);
  palsarImage(dir + "IMG-X", 5, 5);  // code 4
  makeProduct(out + "_hh", 6);
  writeText(out + "_hh_hdr", "[Foreign]\nKept = 1\n");
  makeProduct(out + "_vv", 7);
  makeProduct(out + "_1", 9);
  writeText(out + "_1_slc.TessivorParameterExtracted", "stale store");

  FinishedFocuser focuser;
  focuser.job.outputFilename = out;
  focuser.job.auxFile2 = dir + "LED";
  auto p = basicJob("PALSAR", dir + "IMG-HH", "/tmp/out");
  p[2] = dir + "IMG-VV";
  p[3] = dir + "IMG-X";
  p[5] = out;
  p[22] = "OK";
  tesv_clear_geotiff_requests();
  finishJobProducts(focuser, p, 0);

  for (const char* label : {"hh", "vv", "1"}) {
    const std::string product = out + "_" + label + "_slc";
    EXPECT_TRUE(fs::exists(product)) << product;
    EXPECT_FALSE(fs::exists(out + "_" + label)) << label;
    // The record moved to the store; ".hdr" is now the GeoTIFF step's ENVI header.
    EXPECT_EQ(readText(product + ".hdr").rfind("ENVI\n", 0), 0u) << label;
    EXPECT_TRUE(fs::exists(product + ".TessivorParameterExtracted")) << label;
    EXPECT_EQ(description(product), "ALOS_PALSAR_PLR10") << label;
  }
  EXPECT_EQ(exportedSamples(out + "_vv_slc"), 7);
  EXPECT_NE(readText(out + "_1_slc.TessivorParameterExtracted"), "stale store");
  // The companion text header moved along and its foreign section was kept.
  EXPECT_NE(readText(out + "_hh_slc_hdr").find("[Foreign]\nKept = 1\n"), std::string::npos);
  const auto& requests = tesv_geotiff_requests();
  ASSERT_EQ(requests.size(), 3u);
  EXPECT_EQ(requests[0].source, out + "_hh_slc");
  EXPECT_EQ(requests[1].source, out + "_vv_slc");
  EXPECT_EQ(requests[2].source, out + "_1_slc");

  // ERSDAC jobs get final names but no GeoTIFF; double polarisation tag.
  leader.replace(1108, 4, "   2");
  writeText(dir + "LED", leader);
  makeProduct(out + "_hh", 6);
  makeProduct(out + "_vv", 7);
  p[0] = "PALSAR_ERSDAC";
  p[3] = "NotOK";
  tesv_clear_geotiff_requests();
  finishJobProducts(focuser, p, 0);
  EXPECT_TRUE(tesv_geotiff_requests().empty());
  EXPECT_EQ(description(out + "_vv_slc"), "ALOS_PALSAR_FBD10");
  EXPECT_FALSE(fs::exists(out + "_vv"));

  // Other platforms with a second scene have nothing to finish.
  makeProduct(out + "_hh", 6);
  p[0] = "ERS";
  finishJobProducts(focuser, p, 0);
  EXPECT_TRUE(fs::exists(out + "_hh"));
  EXPECT_TRUE(fs::exists(out + "_hh.hdr"));
}
