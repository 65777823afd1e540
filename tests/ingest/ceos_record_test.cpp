#include "ingest/ceos/ceos_record.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "ingest/ers/ers_ceos_layout.h"
#include "support/files.h"

namespace {

// The archive file, or a skip naming it when the folder is absent.
#define REAL_FILE_OR_SKIP(var, name)                                                 \
  const std::string var = TESSIVOR_REALDATA_DIR "/" name;                            \
  if (!std::filesystem::exists(var)) GTEST_SKIP() << "no archive file " << var;

}  // namespace

// The ERS field tables read the archive leaders: ERS-2 of D-PAF (upper-case
// names, absent biases) and ERS-1 of I-PAF (lower-case names).
TEST(ErsLayoutOnArchiveFiles, LeadersReadThroughTheFieldTables) {
  namespace dss = ers_leader::dss;
  namespace ppr = ers_leader::ppr;
  REAL_FILE_OR_SKIP(ers2, "ers2_2010_orbit77106/LEA_01.001");
  const std::vector<char> bytes = support::readValues<char>(ers2);
  const CeosRecord summary(bytes, ers_leader::kDataSetSummary);
  const CeosRecord position(bytes, ers_leader::kPlatformPosition);
  ASSERT_TRUE(summary.has(dss::kLastLineTime));
  EXPECT_EQ(summary.text(dss::kMissionTag), "ERS2");
  EXPECT_EQ(std::string(summary.at(dss::kPolarisation), 2), "VV");
  EXPECT_DOUBLE_EQ(summary.real(dss::kPrf), 1679.9023438);
  EXPECT_DOUBLE_EQ(summary.real(dss::kSamplingRateMHz), 18.962468);
  EXPECT_DOUBLE_EQ(summary.real(dss::kPulseLengthUs), 37.12);
  EXPECT_DOUBLE_EQ(summary.realExp(dss::kChirpCoefficient), 2.08894e11);
  EXPECT_DOUBLE_EQ(summary.real(dss::kBiasI), -9999999.9999999);
  EXPECT_EQ(summary.text(dss::kFirstLineTime), "18-JAN-2010 17:49:28.683");
  const int vectors = position.integer(ppr::kVectorCount);
  EXPECT_EQ(vectors, 5);
  EXPECT_TRUE(position.has({ppr::kVectorComponent.offset, vectors * ppr::kVectorStride}));
  EXPECT_FALSE(position.has({ppr::kVectorComponent.offset, 1000 * ppr::kVectorStride}));

  REAL_FILE_OR_SKIP(ers1, "ers1_2000_orbit44928/lea_01.001");
  const std::vector<char> bytes1 = support::readValues<char>(ers1);
  const CeosRecord summary1(bytes1, ers_leader::kDataSetSummary);
  const CeosRecord position1(bytes1, ers_leader::kPlatformPosition);
  EXPECT_EQ(summary1.text(dss::kMissionTag), "ERS1");
  EXPECT_DOUBLE_EQ(summary1.real(dss::kPrf), 1679.902);
  EXPECT_DOUBLE_EQ(summary1.real(dss::kBiasI), -0.258);
  EXPECT_DOUBLE_EQ(summary1.real(dss::kBiasQ), -0.095);
  EXPECT_EQ(summary1.text(dss::kFirstLineTime), "17-FEB-2000 09:57:26.417");
  EXPECT_DOUBLE_EQ(position1.realExp(ppr::kInterval), 4.167);
}

// The image table reads the archive image file: descriptor counts and the
// head of the first data record.
TEST(ErsLayoutOnArchiveFiles, ImageDescriptorAndFirstRecordHead) {
  REAL_FILE_OR_SKIP(image, "ers1_2000_orbit44928/dat_01.001");
  const std::vector<char> bytes = support::readValues<char>(image);
  const CeosRecord descriptor(bytes, 0);
  EXPECT_EQ(descriptor.integer(ers_image::descriptor::kRecordCount), 28000);
  EXPECT_EQ(descriptor.integer(ers_image::descriptor::kSamples), 5616);
  const CeosRecord first(bytes, ers_image::kDescriptorLength);
  ASSERT_TRUE(first.has(ers_image::data::kWindowStartCode));
  const auto* record = reinterpret_cast<const unsigned char*>(first.at({0, 1}));
  EXPECT_EQ(ceosBE32(record, ers_image::data::kLineNumber), 1u);
  EXPECT_EQ(ceosBE16(record, ers_image::data::kWindowStartCode), 944);
  // The file is cut inside record 1: its samples are not all there.
  EXPECT_FALSE(first.has({ers_image::kDataPrefix, 2 * 5616}));
}
