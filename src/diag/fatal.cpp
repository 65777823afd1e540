// Fatal path and warning form: the texts of a code go to the _error file
// beside the progress file, the trace and the process log; a fatal error then
// closes the run as failed and ends the process with the code as status.
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "diag/environment.h"
#include "diag/orvane_exception.h"
#include "diag/report.h"

namespace {

constexpr std::size_t CTESV_MAX_LEN_IN_ERROR = 1024;
constexpr std::size_t CTESV_MAX_LINE_IN_ERROR = 32;

bool g_inFatalPath = false;

std::string codeRecord(int code, const std::string& detail) {
  std::string title, message;
  lookupErrorCode(code, title, message);
  return message + " [" + title + "] (" + detail + ") [EC : " + std::to_string(code) + "]";
}

void touch(const std::string& path) {
  std::ofstream(path, std::ios::app);
}

}  // namespace

void writeErrorFile(int code, const std::string& detail, const char* rasterName) {
  std::string title, message;
  lookupErrorCode(code, title, message);

  // Lines of the file: title, message, the detail's lines, then the code,
  // which is always kept.
  std::vector<std::string> lines{title, message};
  std::istringstream detailLines(detail);
  for (std::string line; std::getline(detailLines, line);) lines.push_back(line);
  const std::string codeLine = " [EC : " + std::to_string(code) + "]";

  const std::size_t budget = CTESV_MAX_LEN_IN_ERROR * CTESV_MAX_LINE_IN_ERROR - (codeLine.size() + 1);
  std::string text;
  std::size_t totalLength = 0;
  std::size_t count = 0;
  for (const std::string& full : lines) {
    const std::string line = full.substr(0, CTESV_MAX_LEN_IN_ERROR - 1);
    const std::size_t length = line.size() + 1;
    if (count + 1 >= CTESV_MAX_LINE_IN_ERROR || totalLength + length > budget) {
      traceWrite("writeErrorFile - (aTotLen + aLen) [%zu] > (CTESV_MAX_LEN_IN_ERROR * "
                 "CTESV_MAX_LINE_IN_ERROR) [%zu], text cut\n",
                 totalLength + length, CTESV_MAX_LEN_IN_ERROR * CTESV_MAX_LINE_IN_ERROR);
      break;
    }
    text += line + "\n";
    totalLength += length;
    ++count;
  }
  text += codeLine + "\n";

  const std::string errorPath = progressFilePath() + "_error";
  const std::string temporary = errorPath + "_tmp";
  {
    std::ofstream out(temporary, std::ios::binary | std::ios::trunc);
    out << text;
    if (!out) {
      std::fprintf(stderr, "Error file not written: %s\n", temporary.c_str());
      return;
    }
  }
  if (std::rename(temporary.c_str(), errorPath.c_str()) != 0)
    std::fprintf(stderr, "Error file not written: %s\n", errorPath.c_str());

  if (rasterName && *rasterName) {
    touch(std::string(rasterName) + "_hdr");
    touch(std::string(rasterName) + ".sml");
  }
}

void fatalError(int code, const std::string& detail, const char* function, const char* file,
                int line) {
  const int savedErrno = errno;
  if (!environmentReady())
    throw orvaneException(line, function ? function : "", file ? file : "", codeRecord(code, detail));
  if (g_inFatalPath) std::exit(code);  // a failure while closing a failed run
  g_inFatalPath = true;

  std::string title, message;
  lookupErrorCode(code, title, message);
  writeErrorFile(code, detail, nullptr);
  traceWrite("\nERROR : %s [%s] (%s) \n %s   %s\n    FILE=%s   LINE=%d  (errno = %d)", message.c_str(),
             title.c_str(), detail.c_str(), phaseText().c_str(), function ? function : "",
             file ? file : "", line, savedErrno);
  logWrite("\n\n%s [ERROR ID : %d]\n  %s [%s]\n  %s \n\n", phaseText().c_str(), code,
           message.c_str(), title.c_str(), detail.c_str());
  std::fprintf(stderr, "ERROR %d: %s [%s] (%s)\n", code, message.c_str(), title.c_str(),
               detail.c_str());
  std::fflush(stderr);
  finishRun(code, true, true);
  std::exit(code);
}

void warningReport(int code, const std::string& detail, const char* function, const char* file,
                   int line) {
  const int savedErrno = errno;
  std::string title, message;
  lookupWarningCode(code, title, message);
  traceWrite("\nWARNING : %s [%s] (%s) \n %s   %s\n    FILE=%s   LINE=%d  (errno = %d)",
             message.c_str(), title.c_str(), detail.c_str(), phaseText().c_str(),
             function ? function : "", file ? file : "", line, savedErrno);
  logWrite("\nWARNING : [ERROR ID : %d]%s [%s] (%s) \n %s   %s\n    FILE=%s   LINE=%d  (errno = %d)",
           code, message.c_str(), title.c_str(), detail.c_str(), phaseText().c_str(),
           function ? function : "", file ? file : "", line, savedErrno);
}
