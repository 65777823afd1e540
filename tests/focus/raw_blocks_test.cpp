#include <cmath>
#include <string>
#include <vector>

#include "focus/stripmap_general_focuser.h"
#include "focus_fixture.h"
#include "product/data_set_info.h"
#include "product/roi.h"

namespace {

using M = stripmapGeneralFocuserModular;
using RawBlocks = FocusTest;

// The block tools need no sensor.
class Plain : public M {
 public:
  int ingestion(const std::string&, const std::string&, const std::string&) override { return 0; }
  int ingestion() override { return 0; }
};

ROI_Obj region(double fast0, double dFast, int samples, double slow0, double dSlow, int lines) {
  ROI_Obj r;
  r.SetFastAxe(fast0, dFast, samples);
  r.SetSlowAxe(slow0, dSlow, lines);
  return r;
}

TEST_F(RawBlocks, FocusedBlockMapsToTheRawBlockWithApertureAndReplica) {
  const double dF = 1.0e-7, dS = 1.0e-3;
  const ROI_Obj raw = region(5.0e-3, dF, 1000, 100.0, dS, 2000);
  const ROI_Obj foc = region(5.0e-3 + 100 * dF, dF, 500, 100.0 + 600 * dS, dS, 400);
  ROI_Obj out;
  ASSERT_EQ(M::getFOCroi(raw, foc, 1001, 371, out), 0);
  // Lines 600 - 500 .. 1000 + 500; samples 100 .. 600 + 370.
  EXPECT_EQ(out.Lines, 1400);
  EXPECT_EQ(out.Samples, 870);
  EXPECT_NEAR(out.SlowStartTime, 100.0 + 100 * dS, 1e-9);
  EXPECT_NEAR(out.FastStartTime, 5.0e-3 + 100 * dF, 1e-15);
  EXPECT_DOUBLE_EQ(out.SlowTimeDelta, dS);
  EXPECT_DOUBLE_EQ(out.FastTimeDelta, dF);
  EXPECT_NEAR(out.SlowTimeLength, 1400 * dS, 1e-9);

  int l0, nl, s0, ns;
  ASSERT_EQ(M::getRAWroi(raw, out, &l0, &nl, &s0, &ns), 0);
  EXPECT_EQ(l0, 100);
  EXPECT_EQ(nl, 1400);
  EXPECT_EQ(s0, 100);
  EXPECT_EQ(ns, 870);

  // The aperture reaches before the first raw line, or the replica beyond
  // the last sample.
  EXPECT_EQ(M::getFOCroi(raw, foc, 1300, 371, out), 1);
  EXPECT_EQ(M::getFOCroi(raw, foc, 1001, 402, out), 1);
  EXPECT_EQ(M::getFOCroi(raw, foc, 1001, 401, out), 0);
  EXPECT_TRUE(traced("Requested focused block cannot be obtained from the given extracted data"));

  // A raw block partly outside the raster is clipped to it.
  const ROI_Obj early = region(5.0e-3 - 10 * dF, dF, 50, 100.0 - 5 * dS, dS, 20);
  ASSERT_EQ(M::getRAWroi(raw, early, &l0, &nl, &s0, &ns), 0);
  EXPECT_EQ(l0, 0);
  EXPECT_EQ(nl, 15);
  EXPECT_EQ(s0, 0);
  EXPECT_EQ(ns, 40);
  const ROI_Obj outside = region(5.0e-3, dF, 10, 100.0 + 3000 * dS, dS, 10);
  EXPECT_EQ(M::getRAWroi(raw, outside, &l0, &nl, &s0, &ns), 1);
  EXPECT_EQ(nl, 0);
}

TEST_F(RawBlocks, AlignMovesEveryLineToTheCommonRangeStart) {
  const int lines = 3, S = 4;
  std::vector<fcomplex> px(lines * S);
  for (int l = 0; l < lines; ++l)
    for (int s = 0; s < S; ++s) px[l * S + s] = fcomplex(10.0f * l + s + 1, -1.0f * s);
  // Windows at 0, +2 and +1 samples of 1 us.
  const std::vector<float> swst = {100.0e-6f, 102.0e-6f, 101.0e-6f};
  writeRaster(path("raw"), lines, S, px, DataSetInfo_Obj::IT_RAW_DATA, swst);

  Plain f;
  ASSERT_EQ(f.align_rawdata(path("raw")), 0);
  EXPECT_FALSE(std::filesystem::exists(path("raw_align")));
  const std::vector<fcomplex> out = readComplex(path("raw"));
  ASSERT_EQ(out.size(), static_cast<size_t>(lines * (S + 2)));
  const int shift[3] = {0, 2, 1};
  for (int l = 0; l < lines; ++l)
    for (int s = 0; s < S + 2; ++s) {
      const int src = s - shift[l];
      const fcomplex want = src >= 0 && src < S ? px[l * S + src] : fcomplex(0.0f, 0.0f);
      EXPECT_EQ(out[l * (S + 2) + s], want) << "line " << l << " sample " << s;
    }
  GeneralSAR rec;
  ASSERT_EQ(rec.GSread(path("raw.hdr")), 0);
  EXPECT_TRUE(rec.dataSetInfo.IsImageType(DataSetInfo_Obj::IT_RAW_DATA_ALIGNED));
  EXPECT_EQ(rec.dataFile.NrOfPixelsPerLine, 6);
  EXPECT_EQ(rec.dataFile.RowPrefix, 0);
  EXPECT_EQ(rec.roi.roi.Samples, 6);
  EXPECT_DOUBLE_EQ(rec.roi.roi.FastStartTime, static_cast<double>(100.0e-6f));
  EXPECT_DOUBLE_EQ(rec.dataSetInfo.SWST_MIN, static_cast<double>(100.0e-6f));
  EXPECT_DOUBLE_EQ(rec.dataSetInfo.SWST_MAX, static_cast<double>(100.0e-6f));

  // Aligned data are refused a second time.
  EXPECT_EQ(f.align_rawdata(path("raw")), 1);
  EXPECT_TRUE(traced("Input File is not a not aligned raw data file"));
}

TEST_F(RawBlocks, AlignRefusesAnImpossibleWindowStart) {
  std::vector<fcomplex> px(3 * 2, fcomplex(1.0f, 0.0f));
  writeRaster(path("raw"), 3, 2, px, DataSetInfo_Obj::IT_RAW_DATA,
              {100.0e-6f, std::nanf(""), 100.0e-6f});
  Plain f;
  EXPECT_EQ(f.align_rawdata(path("raw")), 1);
  EXPECT_TRUE(traced("SWST of LINE 1 IS WRONG!"));
  // The input is left untouched.
  GeneralSAR rec;
  ASSERT_EQ(rec.GSread(path("raw.hdr")), 0);
  EXPECT_TRUE(rec.dataSetInfo.IsImageType(DataSetInfo_Obj::IT_RAW_DATA));
  EXPECT_EQ(rec.dataFile.RowPrefix, 4);
}

TEST_F(RawBlocks, CutCopiesARegionOfAlignedRawData) {
  const int lines = 6, S = 5;
  std::vector<fcomplex> px(lines * S);
  for (int l = 0; l < lines; ++l)
    for (int s = 0; s < S; ++s) px[l * S + s] = fcomplex(10.0f * l + s, 0.5f);
  writeRaster(path("raw"), lines, S, px, DataSetInfo_Obj::IT_RAW_DATA_ALIGNED, {}, 1.0e-4,
              1.0e-6, 1000.0, 1.0e-3);
  const ROI_Obj want = region(1.0e-4 + 1.0e-6, 1.0e-6, 3, 1000.0 + 2.0e-3, 1.0e-3, 3);
  Plain f;
  ASSERT_EQ(f.cutRAW(path("raw"), path("cut"), want), 0);
  const std::vector<fcomplex> out = readComplex(path("cut"));
  ASSERT_EQ(out.size(), 9u);
  for (int l = 0; l < 3; ++l)
    for (int s = 0; s < 3; ++s)
      EXPECT_EQ(out[l * 3 + s], fcomplex(10.0f * (l + 2) + (s + 1), 0.5f));
  GeneralSAR rec;
  ASSERT_EQ(rec.GSread(path("cut.hdr")), 0);
  EXPECT_EQ(rec.dataFile.NrOfPixelsPerLine, 3);
  EXPECT_EQ(rec.dataFile.NrOfLinesPerImage, 3);
  EXPECT_EQ(rec.roi.roi.Lines, 3);
  EXPECT_NEAR(rec.roi.roi.SlowStartTime, 1000.002, 1e-9);
  EXPECT_NEAR(rec.roi.roi.FastStartTime, 1.01e-4, 1e-15);
  EXPECT_NEAR(rec.dataSetInfo.SWST_MIN, 1.01e-4, 1e-15);

  // Raw data with window prefixes must be aligned first.
  writeRaster(path("raw2"), 2, 2, std::vector<fcomplex>(4), DataSetInfo_Obj::IT_RAW_DATA,
              {1.0e-4f, 1.0e-4f});
  EXPECT_EQ(f.cutRAW(path("raw2"), path("cut2"), want), 1);
  EXPECT_TRUE(traced("Raw Data must be range aligned!"));
  EXPECT_FALSE(std::filesystem::exists(path("cut2")));
}

}  // namespace
