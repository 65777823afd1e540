#pragma once
// Layout of the ALOS PALSAR level-1.0 CEOS files: record positions and field
// tables, offsets from the record's first byte. The product type tests and
// the extractor read these fields, the simulator's writers write them.
#include "ingest/ceos/ceos_record.h"

namespace palsar_leader {
inline constexpr long kDataSetSummary = 720;
namespace dss {
inline constexpr CeosField kSceneId{20, 32};
inline constexpr CeosField kErsdacDirection{100, 1};     // ERSDAC: "A" ascending
inline constexpr CeosField kChannelCount{388, 4};        // JAXA: polarisations
inline constexpr CeosField kSensorId{412, 32};           // "ALOS -L -1.0" + mode digits
inline constexpr CeosField kSensorMode{424, 2};          // "60" strip, "61" ScanSAR, "62" polarimetric
inline constexpr CeosField kOrbitNumber{444, 8};
inline constexpr CeosField kHeading{468, 8};             // degrees, 3 decimals
inline constexpr CeosField kWavelength{500, 16};         // m
inline constexpr CeosField kChirpSlope{534, 16};         // Hz/s, with exponent
inline constexpr CeosField kChirpSlopeSecond{550, 16};   // read when the first is zero
inline constexpr CeosField kMaxMissingLines{702, 8};
inline constexpr CeosField kBeam{716, 2};                // "32" for ScanSAR wide 1
inline constexpr CeosField kSamplingRateMHz{710, 16};
inline constexpr CeosField kWindowStartUs{726, 16};
inline constexpr CeosField kPulseLengthUs{742, 16};
inline constexpr CeosField kGainHDb{766, 16};
inline constexpr CeosField kGainVDb{782, 16};
inline constexpr CeosField kBiasI{818, 16};
inline constexpr CeosField kBiasQ{834, 16};
inline constexpr CeosField kPrfMilliHz{934, 16};         // polarimetric: twice the PRF of a channel
inline constexpr CeosField kStation{1046, 16};
inline constexpr CeosField kAcquisitionDate{1062, 8};
inline constexpr CeosField kProcessingLevel{1110, 11};   // "UNPROCESSED"
inline constexpr CeosField kDirection{1534, 1};          // JAXA: "A" ascending
inline constexpr CeosField kChirpDigits{1830, 4};
inline constexpr CeosField kBeamNumber{1854, 4};
inline constexpr CeosField kErsdacFacility{1886, 6};     // "VEXCEL" in ERSDAC leaders
// Decimals of the fixed-point fields read by the extractor.
inline constexpr int kDecimals = 7;
inline constexpr int kHeadingDecimals = 3;
}  // namespace dss
}  // namespace palsar_leader

namespace palsar_image {
namespace descriptor {
inline constexpr CeosField kRecordCount{180, 6};
inline constexpr CeosField kRecordLength{186, 6};
inline constexpr CeosField kChannels{232, 4};  // ERSDAC: polarisations
inline constexpr CeosField kSignalRecords{236, 8};
inline constexpr CeosField kPixels{248, 8};
inline constexpr CeosField kChannelOrder{16304, 2};  // ERSDAC, machine order
}  // namespace descriptor
// First signal data record: JAXA files after the 720-byte descriptor,
// ERSDAC files after 16252 bytes. Samples follow a line prefix of 412 bytes
// (JAXA) or 292 bytes (ERSDAC).
inline constexpr long kFirstSignalRecord = 720;
inline constexpr long kErsdacFirstSignalRecord = 16252;
inline constexpr int kJaxaPrefix = 412;
inline constexpr int kErsdacPrefix = 292;
namespace signal {
inline constexpr CeosField kLineNumber{12, 4};  // low three bytes
inline constexpr CeosField kPixels{24, 4};
inline constexpr CeosField kRightFill{28, 4};
inline constexpr CeosField kYear{36, 4};
inline constexpr CeosField kDayOfYear{40, 4};
inline constexpr CeosField kMillisecond{44, 4};
inline constexpr CeosField kPolarisation{52, 4};  // binary: 0, transmit, 0, receive
inline constexpr CeosField kTransmit{52, 2};      // 0 H, 1 V
inline constexpr CeosField kReceive{54, 2};
inline constexpr CeosField kPrfMilliHz{56, 4};
inline constexpr CeosField kScanId{60, 4};
inline constexpr CeosField kNearRangeM{116, 4};
inline constexpr CeosField kFarRangeM{120, 4};
// The instrument's own prefix; bit 2 of its byte 60 marks the 14 MHz chirp
// of a polarimetric line.
inline constexpr CeosField kInstrumentPrefix{288, 100};
inline constexpr CeosField kChirpSelect = kInstrumentPrefix.part(60, 1);
inline constexpr unsigned kNarrowChirpBit = 4;
}  // namespace signal
}  // namespace palsar_image
