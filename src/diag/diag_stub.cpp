// Provisional implementation of the diagnostics layer: reports go to the
// error stream and the fatal path throws. Replaced by the real layer.
#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "diag/ckerr.h"
#include "diag/environment.h"
#include "diag/orvane_exception.h"
#include "diag/report.h"
#include "diag/waitbar.h"

orvaneException::orvaneException() : message_("generic orvane exception.\n") {}
orvaneException::orvaneException(int line, const std::string& function, const std::string& file)
    : line_(line), function_(function), file_(file), errorNumber_(errno) {
  message_ = file + ": " + function + " (" + std::to_string(line) + "): exception found";
}
orvaneException::orvaneException(int line, const std::string& function, const std::string& file,
                                 const std::string& message)
    : message_(message), line_(line), function_(function), file_(file), errorNumber_(errno) {}
orvaneException::orvaneException(const std::string& message)
    : message_(message), line_(-1), function_("UNKNOWN FUNCTION"), file_("UNKNOWN FILE"),
      errorNumber_(errno) {}

static long g_reports = 0;
int orv_add_report(const std::string& message, int level, int line, const char* function,
                   const char* file) {
  ++g_reports;
  if (level <= 2 || level == 6)
    std::fprintf(stderr, "Orvane %d: %s - line : %d - function : %s - file : %s\n", level,
                 message.c_str(), line, function, file);
  return 0;
}
int orv_check(int errnum, int line, const char* function, const char* file) {
  if (errnum == 0) return 0;
  orv_add_report(std::strerror(errnum), 0, line, function, file);
  return 1;
}
int init_report(int, const char*, int) { return 0; }
void exit_report() {}
int ckflg_report() { return 1; }
void set_flg_report(int) {}
long report_count() { return g_reports; }

int init_ckerr_locking() { return 0; }
int ckflg_ckerr() { return 0; }
int set_ckerr_fun(const char*) { return 1; }
void deccurdep() {}
int ckerr_depth() { return 0; }
const char* ckerr_current_function() { return "main()"; }
void* malloc_ckerr(std::size_t size) { return std::malloc(size); }
void* calloc_ckerr(std::size_t count, std::size_t size) { return std::calloc(count, size); }
void free_ckerr(void* address) { std::free(address); }
void freeall_ckerr() {}
void** matalloc_ckerr(int rows, std::size_t rowBytes) {
  void** m = static_cast<void**>(std::malloc(sizeof(void*) * (rows > 0 ? rows : 1)));
  for (int i = 0; i < rows; ++i) m[i] = std::calloc(1, rowBytes);
  return m;
}
void matfree_ckerr(void** matrix, int rows) {
  for (int i = 0; i < rows; ++i) std::free(matrix[i]);
  std::free(matrix);
}
int ckerr_live_allocations() { return 0; }
void exit_ckerr() {}
int write_debug(const char*, const void*, int, int, int) { return 0; }

int waitbar_open(const char*) { return 0; }
int waitbar_update(int, float) { return 0; }
int waitbar_close() { return 0; }

int tesvGetEnv(const char* name, std::string& value) {
  const char* v = std::getenv(name);
  if (!v) return -11;
  value = v;
  return 0;
}
void initEnvironment() {}
bool environmentReady() { return false; }
void resetEnvironment() {}
static std::string g_phase;
void setPhaseText(const std::string& text) { g_phase = " " + text; }
const std::string& phaseText() { return g_phase; }
void logStart(const std::vector<std::string>&, const std::string&, const std::string&) {}
void logEnd() {}
void finishRun(int, bool, bool) {}
void traceWrite(const char*, ...) {}
void logWrite(const char*, ...) {}
bool tracingActive() { return false; }
void lookupErrorCode(int code, std::string& title, std::string& message) {
  title = "AN ERROR OCCUR DURING Tessivor INIT";
  message = std::to_string(code);
}
void fatalError(int code, const std::string& detail, const char* function, const char* file,
                int line) {
  throw orvaneException(line, function, file, detail + " [" + std::to_string(code) + "]");
}
void warningReport(int, const std::string&, const char*, const char*, int) {}
void writeErrorFile(int, const std::string&, const char*) {}
void moveFileSet(const std::string&, const std::string&, bool) {}
bool getAndSetPerc(int, int, const char*) { return true; }
