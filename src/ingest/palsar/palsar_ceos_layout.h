#pragma once
// Layout of the ALOS PALSAR level-1.0 CEOS files as far as the product type
// tests read them: record positions and field tables, offsets from the
// record's first byte.
#include "ingest/ceos/ceos_record.h"

namespace palsar_leader {
inline constexpr long kDataSetSummary = 720;
namespace dss {
inline constexpr CeosField kChannelCount{388, 4};        // JAXA: polarisations
inline constexpr CeosField kSensorMode{424, 2};          // "61" with a ScanSAR beam
inline constexpr CeosField kBeam{716, 2};                // "32" for ScanSAR wide 1
inline constexpr CeosField kProcessingLevel{1110, 11};   // "UNPROCESSED"
inline constexpr CeosField kErsdacFacility{1886, 6};     // "VEXCEL" in ERSDAC leaders
}  // namespace dss
}  // namespace palsar_leader

namespace palsar_image {
namespace descriptor {
inline constexpr CeosField kChannels{232, 4};  // ERSDAC: polarisations
inline constexpr CeosField kChannelOrder{16304, 2};  // ERSDAC, machine order
}  // namespace descriptor
// First signal data record and its transmit / receive polarisation codes.
inline constexpr long kFirstSignalRecord = 720;
namespace signal {
inline constexpr CeosField kPolarisation{52, 4};  // binary: 0, transmit, 0, receive
}  // namespace signal
}  // namespace palsar_image
