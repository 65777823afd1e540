#pragma once

// Integer status of every operation. A called function's status is handed
// up unchanged.
enum Status : int {
  STATUS_OK = 0,
  STATUS_BAD_CONDITION = 1,
  STATUS_READ_FAILED = 4,      // "File reading failed!"
  STATUS_WRITE_FAILED = 5,     // "File writing failed!"
  STATUS_NO_MEMORY = 7,
  STATUS_NO_MEMORY_ALT = 8,
  STATUS_NOT_OPENED = 9,       // "File not opened!"
  STATUS_BAD_PARAMETER = 10,   // bad or missing parameter
};

// Codes of the fatal path: 65280 x primary + secondary.
constexpr int errorCode(int primary, int secondary) { return 65280 * primary + secondary; }

enum ErrorCode : int {
  EC_STAGE_FAILED = 130560,          // 2, 0
  EC_FILE_NOT_FOUND = 261122,        // 4, 2
  EC_COMPANION_NOT_MOVED = 261123,   // 4, 3
  EC_INTERRUPTED = 326400,           // 5, 0
  EC_TOO_FEW_PARAMETERS = 456962,    // 7, 2
  EC_BAD_COMMAND = 456963,           // 7, 3
  EC_XCA_MISSING = 1305601,          // 20, 1
  EC_DORVOR_MISSING = 1305602,       // 20, 2
  EC_INS_MISSING = 1305603,          // 20, 3
  EC_XCH_MISSING = 1305604,          // 20, 4
  EC_IMAGE_MISSING = 1305605,        // 20, 5
  EC_FILE_IO = 1305606,              // 20, 6
  EC_BURST_SYNC = 1370881,           // 21, 1
  EC_DEM_NOT_COVERING = 1370882,     // 21, 2
  EC_DEM_MISSING = 1370883,          // 21, 3
  EC_OVERLAP = 1370884,              // 21, 4
};
static_assert(EC_STAGE_FAILED == errorCode(2, 0));
static_assert(EC_OVERLAP == errorCode(21, 4));
