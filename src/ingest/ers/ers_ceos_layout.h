#pragma once
// Layout of the ERS-1/2 level-0 CEOS files: record positions and one field
// table per record, offsets from the record's first byte. The extractor and
// the product type tests read these fields, the simulator's writer writes
// them; a field is described here and nowhere else.
#include "ingest/ceos/ceos_record.h"

// ---- Leader file (LEA_01.001) --------------------------------------------------------
namespace ers_leader {

// Records: file descriptor, data set summary, platform position, then two
// facility related data records.
inline constexpr long kFileDescriptor = 0;
inline constexpr int kFileDescriptorLength = 720;
inline constexpr long kDataSetSummary = 720;
inline constexpr int kDataSetSummaryLength = 1886;
inline constexpr long kPlatformPosition = kDataSetSummary + kDataSetSummaryLength;  // 2606
inline constexpr int kFacilityLength = 12288;

// File descriptor record: the common head (see ceos_descriptor) and the
// record counts and lengths of the leader.
namespace fdr {
inline constexpr CeosField kSummaryCount{180, 6};
inline constexpr CeosField kSummaryLength{186, 6};
inline constexpr CeosField kMapProjectionCount{192, 6};
inline constexpr CeosField kMapProjectionLength{198, 6};
inline constexpr CeosField kPositionCount{204, 6};
inline constexpr CeosField kPositionLength{210, 6};
// Attitude to ground control point records: count and length pairs.
inline constexpr CeosField kOtherCount{216, 6};
inline constexpr CeosField kOtherLength{222, 6};
inline constexpr int kOtherStride = 12;
inline constexpr int kOtherKinds = 12;
inline constexpr CeosField kFacilityCount{420, 6};
inline constexpr CeosField kFacilityLength{426, 6};
}  // namespace fdr

// Data set summary record.
namespace dss {
inline constexpr CeosField kSequence{12, 4};
inline constexpr CeosField kSarChannel{16, 4};
inline constexpr CeosField kSceneId{20, 32};  // read as the scene identifier
inline constexpr CeosField kSceneDesignator{36, 32};
inline constexpr CeosField kSceneCentreTime{68, 32};
inline constexpr CeosField kSceneCentreLat{116, 16};
inline constexpr CeosField kSceneCentreLon{132, 16};
inline constexpr CeosField kSceneCentreHeading{148, 16};
inline constexpr CeosField kEllipsoid{164, 16};
inline constexpr CeosField kSemiMajorKm{180, 16};
inline constexpr CeosField kSemiMinorKm{196, 16};
inline constexpr CeosField kEarthMass{212, 16};
inline constexpr CeosField kJ2{244, 16};
inline constexpr CeosField kJ3{260, 16};
inline constexpr CeosField kJ4{276, 16};
inline constexpr CeosField kCentreLine{324, 8};
inline constexpr CeosField kCentrePixel{332, 8};
inline constexpr CeosField kSceneLengthKm{340, 16};
inline constexpr CeosField kSceneWidthKm{356, 16};
inline constexpr CeosField kChannelCount{388, 4};
inline constexpr CeosField kMission{396, 16};  // "ERS1" or "ERS2"
inline constexpr CeosField kMissionTag = kMission.part(0, 4);
inline constexpr CeosField kSensorId{412, 32};  // "   SAR- C-HR-IM-VV"
inline constexpr CeosField kPolarisation = kSensorId.part(16, 2);
inline constexpr CeosField kOrbitNumber{444, 8};
inline constexpr CeosField kPlatformLat{452, 8};
inline constexpr CeosField kPlatformLon{460, 8};
inline constexpr CeosField kPlatformHeading{468, 8};
inline constexpr CeosField kClockAngle{476, 8};
inline constexpr CeosField kIncidence{484, 8};
inline constexpr CeosField kRadarFrequencyGHz{492, 8};
inline constexpr CeosField kWavelength{502, 16};
inline constexpr CeosField kPulseCode{518, 16};
inline constexpr CeosField kPulseAmplitude{534, 16};  // five coefficients
inline constexpr CeosField kPulsePhase{614, 16};      // five coefficients
inline constexpr int kPulseCoefficientStride = 16;
inline constexpr int kPulseCoefficients = 5;
inline constexpr CeosField kChirpCoefficient = kPulsePhase.element(2, kPulseCoefficientStride);
inline constexpr CeosField kChirpExtractionIndex{694, 8};
inline constexpr CeosField kSamplingRateMHz{710, 16};
inline constexpr CeosField kRangeGateStart{726, 16};
inline constexpr CeosField kPulseLengthUs{742, 16};
inline constexpr CeosField kBasebandConversion{762, 4};
inline constexpr CeosField kQuantisationBits{798, 8};
inline constexpr CeosField kQuantiser{806, 12};
inline constexpr CeosField kBiasI{818, 16};
inline constexpr CeosField kBiasQ{834, 16};
inline constexpr CeosField kGainImbalance{850, 16};
inline constexpr CeosField kBoresight{914, 16};
inline constexpr CeosField kPrf{934, 16};
inline constexpr CeosField kFirstLineCompact{998, 32};
inline constexpr CeosField kFacility{1046, 16};  // read as the acquisition station
inline constexpr CeosField kProcessingSystem{1062, 8};
inline constexpr CeosField kProcessingVersion{1070, 8};
inline constexpr CeosField kProductType{1110, 32};  // "SAR RAW SIGNAL DATA"
inline constexpr CeosField kProductLevel = kProductType.part(4, 3);  // "RAW"
inline constexpr CeosField kProcessingReals{1174, 16};  // six unset reals
inline constexpr int kProcessingRealCount = 6;
inline constexpr CeosField kDataInputSource{1334, 16};
inline constexpr CeosField kUnsetA{1350, 16};
inline constexpr CeosField kUnsetB{1366, 16};
// Four groups of three unset reals.
inline constexpr CeosField kUnsetGroups[4] = {{1414, 16}, {1478, 16}, {1542, 16}, {1606, 16}};
inline constexpr int kUnsetGroupStride = 16;
inline constexpr CeosField kPixelTimeDirection{1526, 8};
inline constexpr CeosField kLineTimeDirection{1534, 8};
inline constexpr CeosField kLineContent{1670, 8};
inline constexpr CeosField kClutterLock{1678, 4};
inline constexpr CeosField kAutofocus{1682, 4};
inline constexpr CeosField kLineSpacing{1686, 16};
inline constexpr CeosField kPixelSpacing{1702, 16};
inline constexpr CeosField kFirstRangeTimeMs{1766, 16};
inline constexpr CeosField kCentreRangeTimeMs{1782, 16};
inline constexpr CeosField kLastRangeTimeMs{1798, 16};
inline constexpr CeosField kFirstLineTime{1814, 24};
inline constexpr CeosField kCentreLineTime{1838, 24};
inline constexpr CeosField kLastLineTime{1862, 24};
}  // namespace dss

// Platform position record.
namespace ppr {
inline constexpr CeosField kVectorCount{140, 4};
inline constexpr CeosField kYear{144, 4};
inline constexpr CeosField kMonth{148, 4};
inline constexpr CeosField kDay{152, 4};
inline constexpr CeosField kDayDigits = kDay.part(2, 2);  // the day as the extractor reads it
inline constexpr CeosField kDayOfYear{156, 4};
inline constexpr CeosField kSecondsOfDay{160, 22};
inline constexpr CeosField kInterval{182, 22};
inline constexpr CeosField kReferenceSystem{204, 64};
inline constexpr CeosField kGreenwichAngle{268, 22};
inline constexpr CeosField kPositionErrors{290, 16};  // three unset reals
inline constexpr int kPositionErrorStride = 16;
// Vectors: x y z vx vy vz, one group of six D22.15 fields per vector.
inline constexpr CeosField kVectorComponent{386, 22};
inline constexpr int kComponentStride = 22;
inline constexpr int kVelocityOffset = 66;
inline constexpr int kVectorStride = 132;
// Record length for n vectors.
constexpr int length(int vectors) { return kVectorComponent.offset + kVectorStride * vectors; }
}  // namespace ppr

// Facility related data record.
namespace facility {
inline constexpr CeosField kTitle{12, 64};
}  // namespace facility

}  // namespace ers_leader

// ---- Image file (DAT_01.001) ----------------------------------------------------------
namespace ers_image {

// Image file descriptor record.
inline constexpr int kDescriptorLength = 11644;
namespace descriptor {
inline constexpr CeosField kRecordCount{180, 6};
inline constexpr CeosField kRecordLength{186, 6};
inline constexpr CeosField kBitsPerSample{216, 4};
inline constexpr CeosField kSamplesPerGroup{220, 4};
inline constexpr CeosField kBytesPerGroup{224, 4};
inline constexpr CeosField kChannels{232, 4};
inline constexpr CeosField kLines{236, 8};
inline constexpr CeosField kBorderPixels{244, 4};
inline constexpr CeosField kSamples{248, 8};
inline constexpr CeosField kBorderRight{256, 4};
inline constexpr CeosField kTopBorder{260, 4};
inline constexpr CeosField kBottomBorder{264, 4};
inline constexpr CeosField kInterleave{268, 4};
inline constexpr CeosField kRecordsPerLine{272, 2};
inline constexpr CeosField kRecordsPerChannel{274, 2};
inline constexpr CeosField kPrefixBytes{276, 4};
inline constexpr CeosField kDataBytes{280, 8};
inline constexpr CeosField kSuffixBytes{288, 4};
inline constexpr CeosField kRepeatFlag{292, 4};
inline constexpr CeosField kLocators{296, 8};  // five locators
inline constexpr int kLocatorStride = 8;
inline constexpr CeosField kDataFormat{400, 28};
inline constexpr CeosField kDataFormatCode{428, 4};
inline constexpr CeosField kLeftFill{432, 4};
inline constexpr CeosField kRightFill{436, 4};
inline constexpr CeosField kMaximumValue{440, 8};
}  // namespace descriptor

// Data record: a 412-byte prefix, then I and Q bytes per sample.
inline constexpr int kDataPrefix = 412;
namespace data {
inline constexpr CeosField kLineNumber{12, 4};  // binary, from 1
inline constexpr CeosField kImageRecord{16, 4};
// Instrument auxiliary data.
inline constexpr CeosField kSyncA{202, 1};
inline constexpr CeosField kSyncB{208, 1};
inline constexpr CeosField kFormatCounter{210, 4};
inline constexpr CeosField kWindowStartCode{214, 2};
inline constexpr CeosField kPriCode{216, 2};
inline constexpr CeosField kGainA{218, 1};
inline constexpr CeosField kGainB{219, 1};
}  // namespace data

}  // namespace ers_image
