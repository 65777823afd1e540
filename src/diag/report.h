#pragma once
#include <string>

// Numbered report levels with fixed meanings; 7 to 13 and 19 to 21 end the run.
enum ReportLevel : int {
  REPORT_ERROR = 0,
  REPORT_WARNING = 1,
  REPORT_CHECKPOINT = 2,
  REPORT_ERROR_CALL_TREE = 3,
  REPORT_CORRECT_FUNCTION_CALL = 4,
  REPORT_CORRECT_SYSTEM_CALL = 5,
  REPORT_MESSAGE = 6,
  REPORT_XCA_MISSING = 7,
  REPORT_XCH_MISSING = 8,
  REPORT_DORVOR_MISSING = 9,
  REPORT_INS_MISSING = 10,
  REPORT_DEM_NOT_COVERING = 11,
  REPORT_DEM_MISSING = 12,
  REPORT_IMAGE_MISSING = 13,
  REPORT_BURST_SYNC = 19,
  REPORT_OVERLAP = 20,
  REPORT_FILE_IO = 21,
};

// Composes "%s - line : %d - function : %s - file : %s" and writes it where
// the level says; fatal levels take the fatal path and do not return.
int orv_add_report(const std::string& message, int level, int line, const char* function,
                   const char* file);
// Reports strerror(errnum) at level 0 when errnum is not 0; returns errnum != 0.
int orv_check(int errnum, int line, const char* function, const char* file);

int init_report(int unused, const char* title, int level);
void exit_report();
int ckflg_report();
void set_flg_report(int value);
// Number of reports written since start (for tests and the end of the run).
long report_count();

// Report at the caller's position.
#define ORV_REPORT(message, level) orv_add_report((message), (level), __LINE__, __func__, __FILE__)
// The message every function on the way up gives when a callee failed.
#define ORV_REPORT_CALLED_ERROR() \
  orv_add_report("Called function returned ERROR", REPORT_ERROR_CALL_TREE, __LINE__, __func__, __FILE__)
