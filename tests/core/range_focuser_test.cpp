#include "core/range_focuser.h"

#include <gtest/gtest.h>

#include <cmath>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "product/general_sar.h"
#include "support/files.h"
#include "support/scenes.h"

namespace {

using namespace support::raw;

class RangeFocuserTest : public ::testing::Test {
 protected:
  std::string path(const std::string& name) const { return dir_ / name; }
  support::TempFolder dir_{"rangefocuser"};

  // Raw raster of the scene with its record.
  void writeRaw(const Scene& sc, const std::string& raw, const char* imageType = "RAW DATA") {
    sc.write(raw);
    GeneralSAR rec;
    rec.dataFile.filename = raw;
    rec.dataFile.NrOfPixelsPerLine = sc.samples;
    rec.dataFile.NrOfLinesPerImage = sc.lines;
    rec.dataFile.RowPrefix = 4;
    rec.dataFile.HeaderOffset = 0;
    rec.dataFile.CellType = FLOAT_COMPLEX;
    rec.roi.roi.SetFastAxe(sc.swstMin, 1.0 / sc.pulse.fs, sc.samples);
    rec.roi.roi.SetSlowAxe(6.0e8, 1.0 / 1679.9, sc.lines);
    rec.sampling.frg_hz = sc.pulse.fs;
    rec.sampling.Trg_s = 1.0 / sc.pulse.fs;
    rec.sampling.prf_hz = 1679.9;
    rec.pulse.PulseLength = sc.pulse.T;
    rec.pulse.Bandwidth = sc.pulse.B;
    rec.pulse.PulseKRate = sc.pulse.rate();
    rec.pulse.PulseSamplingRate = sc.pulse.fs;
    rec.dataSetInfo.ImageType = imageType;
    rec.dataSetInfo.SetAcqMode(DataSetInfo_Obj::AM_STRIPMAP);
    rec.dataSetInfo.SWST_MIN = sc.swstMin;
    rec.dataSetInfo.SWST_MAX = sc.swstMax();
    rec.swath.Acquisition_Start_Time = 6.0e8;
    for (auto o : {GeneralSAR::GS_DATAFILE, GeneralSAR::GS_ROI, GeneralSAR::GS_SAMPLING,
                   GeneralSAR::GS_PULSE, GeneralSAR::GS_DATASETINFO, GeneralSAR::GS_SWATH})
      rec.GSenable(o);
    ASSERT_EQ(rec.GSwrite(raw + ".hdr"), 0);
  }

};

TEST_F(RangeFocuserTest, FocusesAlignsAndUpdatesTheRecord) {
  const Scene sc = makeScene();
  writeRaw(sc, path("raw"));
  const auto replica = sc.pulse.replica();

  ATRangeFocuser f;
  f.RawData = path("raw");
  f.OutputFile = path("rgfoc");
  f.ChirpBuf = replica;
  f.ChirpLen = static_cast<int>(replica.size());
  f.Flag_ortog = 0;
  f.Memory = 1;  // a few lines per block: several blocks
  ASSERT_EQ(f.run(), 0);
  EXPECT_EQ(f.getLinesToProcess(), sc.lines);

  // The rows are those of the range compression (pinned by its own tests):
  // here their number and length, and the record that describes them.
  const int O = sc.samples - sc.pulse.n() + 1 + sc.maxShift;
  ASSERT_EQ(support::readComplex(path("rgfoc")).size(), static_cast<std::size_t>(O) * sc.lines);

  GeneralSAR rec;
  ASSERT_EQ(rec.GSread(path("rgfoc") + ".hdr"), 0);
  EXPECT_TRUE(rec.dataSetInfo.IsImageType(DataSetInfo_Obj::IT_RANGE_FOCUSED));
  EXPECT_EQ(rec.roi.roi.Samples, O);
  EXPECT_DOUBLE_EQ(rec.roi.roi.FastStartTime, sc.swstMin);
  EXPECT_NEAR(rec.roi.roi.FastTimeLength, O / sc.pulse.fs, 1e-15);
  EXPECT_NEAR(rec.roi.roi.SlowTimeLength, sc.lines / 1679.9, 1e-12);
  EXPECT_EQ(rec.dataFile.NrOfPixelsPerLine, O);
  EXPECT_EQ(rec.dataFile.NrOfLinesPerImage, sc.lines);
  EXPECT_EQ(rec.dataFile.RowPrefix, 0);
}

TEST_F(RangeFocuserTest, SkipAndProcessPercentagesAndTheRecordTimes) {
  Scene sc = makeScene();
  writeRaw(sc, path("raw"));
  const auto replica = sc.pulse.replica();
  ATRangeFocuser f;
  f.RawData = path("raw");
  f.OutputFile = path("rgfoc");
  f.ChirpBuf = replica;
  f.Flag_ortog = 0;
  f.DataToSkip = 25;
  f.DataToProcess = 50;
  ASSERT_EQ(f.run(), 0);
  EXPECT_EQ(f.getLinesToSkip(), 10);
  EXPECT_EQ(f.getLinesToProcess(), 20);
  GeneralSAR rec;
  ASSERT_EQ(rec.GSread(path("rgfoc") + ".hdr"), 0);
  EXPECT_NEAR(rec.roi.roi.SlowStartTime, 6.0e8 + 10 / 1679.9, 1e-6);
  EXPECT_NEAR(rec.swath.Acquisition_Start_Time, 6.0e8 + 10 / 1679.9, 1e-6);
  const int O = sc.samples - sc.pulse.n() + 1 + sc.maxShift;
  const auto out = support::readComplex(path("rgfoc"));
  ASSERT_EQ(out.size(), static_cast<std::size_t>(O) * 20);
  // Line 10 of the scene is the first output line: its peaks are in place.
  EXPECT_NEAR(std::abs(out[sc.targets[0].peak]), sc.pulse.n(), 1e-3 * sc.pulse.n());

  // 30 + 70 is not below 100: the rest of the scene.
  f.DataToSkip = 30;
  f.DataToProcess = 70;
  ASSERT_EQ(f.run(), 0);
  EXPECT_EQ(f.getLinesToSkip(), 12);
  EXPECT_EQ(f.getLinesToProcess(), 28);
}

TEST_F(RangeFocuserTest, ReplicaPriorityAndFailures) {
  Scene sc = makeScene();
  sc.lines = 6;
  sc.shifts.resize(6);
  writeRaw(sc, path("raw"));

  // No buffer, no raster: the synthetic pulse of the record, round(T / Trg) long.
  ATRangeFocuser f;
  f.RawData = path("raw");
  f.OutputFile = path("rgfoc");
  f.ChirpFile = path("no_chirp");
  ASSERT_EQ(f.run(), 0);
  EXPECT_EQ(f.ChirpLen, sc.pulse.n());

  // A replica raster wins over the pulse; its length is its row.
  {
    DataFile chirp;
    chirp.filename = path("chirp");
    chirp.NrOfPixelsPerLine = 100;
    chirp.NrOfLinesPerImage = 1;
    std::vector<fcomplex> r(100, fcomplex(1, 0));
    ASSERT_EQ(chirp.open(1), 0);
    ASSERT_EQ(chirp.write(r.data(), 800), 0);
    chirp.close();
    ASSERT_EQ(chirp.write_hdr(), 0);
  }
  f.ChirpFile = path("chirp");
  ASSERT_EQ(f.run(), 0);
  EXPECT_EQ(f.ChirpLen, 100);

  // A replica longer than the line.
  f.ChirpBuf.assign(sc.samples + 1, fcomplex(1, 0));
  f.ChirpLen = sc.samples + 1;
  EXPECT_EQ(f.run(), 1);

  // A wrong SWST ends the run.
  Scene bad = sc;
  bad.shifts[4] = sc.maxShift + 3;
  writeRaw(bad, path("bad"));
  f.RawData = path("bad");
  f.ChirpBuf = sc.pulse.replica();
  f.ChirpLen = sc.pulse.n();
  EXPECT_EQ(f.run(), 1);

  // Not a raw raster.
  writeRaw(sc, path("slc"), "AZIMUTH FOCUSED");
  f.RawData = path("slc");
  EXPECT_EQ(f.run(), 1);
}

}  // namespace
