// Numbered reports: composes the text with its position and writes it to the
// trace and the process log as the level says; fatal levels end the run.
#include "diag/report.h"

#include <cstring>

#include "base/status.h"
#include "diag/ckerr.h"
#include "diag/environment.h"

namespace {

int g_reportFlag = 0;
long g_reportCount = 0;

struct LevelInfo {
  const char* word;
  int fatalCode;  // 0: the level does not end the run
};

LevelInfo levelInfo(int level) {
  switch (level) {
    case REPORT_ERROR: return {"ERROR", 0};
    case REPORT_WARNING: return {"WARNING", 0};
    case REPORT_CHECKPOINT: return {"CHECKPOINT", 0};
    case REPORT_ERROR_CALL_TREE: return {"ERROR_CALL_TREE", 0};
    case REPORT_CORRECT_FUNCTION_CALL: return {"CORRECT_FUNCTION_CALL", 0};
    case REPORT_CORRECT_SYSTEM_CALL: return {"CORRECT_SYSTEM_CALL", 0};
    case REPORT_MESSAGE: return {"MESSAGE", 0};
    case REPORT_XCA_MISSING: return {"XCA DOES NOT EXIST", EC_XCA_MISSING};
    case REPORT_XCH_MISSING: return {"XCH DOES NOT EXIST", EC_XCH_MISSING};
    case REPORT_DORVOR_MISSING: return {"DORVOR DOES NOT EXIST", EC_DORVOR_MISSING};
    case REPORT_INS_MISSING: return {"INS DOES NOT EXIST", EC_INS_MISSING};
    case REPORT_DEM_NOT_COVERING: return {"DEM DOES NOT COVER WHOLE IMAGE", EC_DEM_NOT_COVERING};
    case REPORT_DEM_MISSING: return {"DEM DOES NOT EXIST", EC_DEM_MISSING};
    case REPORT_IMAGE_MISSING: return {"IMAGE DOES NOT EXIST", EC_IMAGE_MISSING};
    case REPORT_BURST_SYNC: return {"BURST SYNC ERROR", EC_BURST_SYNC};
    case REPORT_OVERLAP: return {"OVERLAP ERROR", EC_OVERLAP};
    case REPORT_FILE_IO: return {"FILE I/O ERROR", EC_FILE_IO};
    default: return {"UNKNOWN", 0};
  }
}

bool reportsWritten() { return g_reportFlag >= 1 && g_reportFlag <= 3; }

}  // namespace

int orv_add_report(const std::string& message, int level, int line, const char* function,
                   const char* file) {
  const std::string composed = message + " - line : " + std::to_string(line) +
                               " - function : " + (function ? function : "") +
                               " - file : " + (file ? file : "");
  if (!reportsWritten()) return 0;
  ++g_reportCount;
  const LevelInfo info = levelInfo(level);
  switch (level) {
    case REPORT_ERROR:
      traceWrite("Orvane %s: %s\n", info.word, composed.c_str());
      logWrite("PROCESSING ERROR: %s - Orvane\n", composed.c_str());
      return 0;
    case REPORT_WARNING:
    case REPORT_CHECKPOINT:
    case REPORT_MESSAGE:
      traceWrite("Orvane %s: %s\n", info.word, composed.c_str());
      return 0;
    default:
      break;
  }
  if (info.fatalCode != 0) {
    traceWrite("Orvane %s: %s\n", info.word, composed.c_str());
    logWrite("PROCESSING ERROR: %s - Orvane\n", composed.c_str());
    fatalError(info.fatalCode, message, function ? function : "", file ? file : "", line);
  }
  return 0;
}

int orv_check(int errnum, int line, const char* function, const char* file) {
  if (errnum == 0) return 0;
  orv_add_report(std::strerror(errnum), REPORT_ERROR, line, function, file);
  return STATUS_BAD_CONDITION;
}

int init_report(int /*unused*/, const char* /*title*/, int level) {
  if (reportsWritten()) return 0;
  g_reportFlag = (ckflg_ckerr() && level >= 1 && level <= 3) ? level : 0;
  return 0;
}

void exit_report() {}

int ckflg_report() { return g_reportFlag; }

void set_flg_report(int value) { g_reportFlag = value; }

long report_count() { return g_reportCount; }
