#pragma once
#include <string>
#include <vector>

// Contact with the host: TESSIVOR_* variables, Process.log / Process.trace,
// error catalogues, the _error file and the progress file.

// 0 if the variable is set (value copied as the host wrote it), -11 otherwise.
int tesvGetEnv(const char* name, std::string& value);
// Value of a TESSIVOR_* variable, or where it is unset its default: the
// installed resources folder for the description-file directories, the
// current folder for TESSIVOR_WORKING_DIR, empty for the others.
std::string tesvEnvOrDefault(const char* name);

// Reads the variables, opens the logs and loads the catalogues.
// After this call the fatal path writes files and exits instead of throwing.
void initEnvironment();
bool environmentReady();
// Progress file of the run: TESSIVOR_WORKING_FILE (joined to the working
// directory when it holds no '/'), "Tessivor_progress.txt" when unset.
const std::string& progressFilePath();
const std::string& workingDirectory();
// Resets everything initEnvironment set up (for tests that run several
// environments in one process).
void resetEnvironment();

void setPhaseText(const std::string& text);
const std::string& phaseText();

void logStart(const std::vector<std::string>& parameters, const std::string& title,
              const std::string& text);
void logEnd();
void finishRun(int code, bool writeLogs, bool closeLogs);

void traceWrite(const char* format, ...) __attribute__((format(printf, 1, 2)));
void logWrite(const char* format, ...) __attribute__((format(printf, 1, 2)));
bool tracingActive();

// Texts of a code from the catalogues: group title and message.
void lookupErrorCode(int code, std::string& title, std::string& message);
void lookupWarningCode(int code, std::string& title, std::string& message);

// Fatal path: _error file, trace, log, failed close, exit(code).
// Throws orvaneException instead while the environment is not ready.
[[noreturn]] void fatalError(int code, const std::string& detail, const char* function,
                             const char* file, int line);
void warningReport(int code, const std::string& detail, const char* function, const char* file,
                   int line);
#define TESV_FATAL(code, detail) fatalError((code), (detail), __func__, __FILE__, __LINE__)

void writeErrorFile(int code, const std::string& detail, const char* rasterName);
void moveFileSet(const std::string& source, const std::string& target, bool withCompanions);

// Progress protocol; false when the operator stopped the run.
bool getAndSetPerc(int oldPercentage, int newPercentage, const char* message);
