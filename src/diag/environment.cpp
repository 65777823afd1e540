// Contact with the host: TESSIVOR_* variables, the process log and trace with
// their banners, the error catalogues and the close of a run.
#include "diag/environment.h"

#include <unistd.h>

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <memory>

#include "diag/error_catalog.h"
#include "diag/waitbar.h"

#ifndef TESSIVOR_DEFAULT_RESOURCE_DIR
#define TESSIVOR_DEFAULT_RESOURCE_DIR "resources/"
#endif

namespace {

namespace fs = std::filesystem;

constexpr std::size_t kFormatBuffer = 25000;
constexpr std::size_t kPhaseMax = 80;
const std::string kSeparatorLine(160, '-');

struct FileCloser {
  void operator()(FILE* f) const {
    if (f) std::fclose(f);
  }
};
using File = std::unique_ptr<FILE, FileCloser>;

struct EnvironmentState {
  bool ready = false;
  bool tracing = false;
  std::string workingDir;
  std::string progressFile;
  std::string logPath;
  std::string tracePath;
  File log;
  File trace;
  File traceCerr;
  File traceCout;
  std::string runTitle;
  ErrorCatalogue errors;
  ErrorCatalogue warnings;
};

EnvironmentState& env() {
  static EnvironmentState s;
  return s;
}

std::string& phase() {
  static std::string p;
  return p;
}

bool isDescriptionDirectory(const std::string& name) {
  return name == "TESSIVOR_CEOS_DES_FILES_DIR" || name == "TESSIVOR_ORVANE_DES_FILES_DIR" ||
         name == "TESSIVOR_OTHER_01_DES_FILES_DIR" || name == "TESSIVOR_XML_SCHEMA_DES_FILES_DIR";
}

std::string currentFolder() {
  std::error_code ec;
  fs::path cwd = fs::current_path(ec);
  if (ec) return "./";
  std::string text = cwd.string();
  if (text.empty() || text.back() != '/') text += '/';
  return text;
}

std::string formattedTime(const char* format) {
  std::time_t now = std::time(nullptr);
  std::tm local{};
  localtime_r(&now, &local);
  char buffer[64];
  std::strftime(buffer, sizeof buffer, format, &local);
  return buffer;
}

// Date text of the banners, in the calendar form that ends with a newline.
std::string dateText() { return formattedTime("%a %b %d %H:%M:%S %Y\n"); }

void writeBoth(const std::string& text) {
  EnvironmentState& s = env();
  for (FILE* f : {s.log.get(), s.trace.get()}) {
    if (!f) continue;
    std::fputs(text.c_str(), f);
    std::fflush(f);
  }
}

void vwrite(FILE* f, const char* format, va_list args) {
  if (!f) return;
  std::vector<char> buffer(kFormatBuffer);
  std::vsnprintf(buffer.data(), buffer.size(), format, args);
  std::fputs(buffer.data(), f);
  std::fflush(f);
}

void copyQuietly(const std::string& from, const std::string& to) {
  std::error_code ec;
  fs::copy_file(from, to, fs::copy_options::overwrite_existing, ec);
}

void loadCatalogue(ErrorCatalogue& catalogue, const std::string& path) {
  std::string problem;
  if (catalogue.load(path, problem)) return;
  std::fprintf(stderr, "Error catalogue not loaded: %s\n", problem.c_str());
  if (env().log) {
    std::fprintf(env().log.get(), "Error catalogue not loaded: %s\n", problem.c_str());
    std::fflush(env().log.get());
  }
}

void closeLogs() {
  EnvironmentState& s = env();
  s.log.reset();
  if (s.trace) {
    s.trace.reset();
    copyQuietly(s.tracePath, s.tracePath + "_save");
  }
  s.traceCerr.reset();
  s.traceCout.reset();
}

}  // namespace

int tesvGetEnv(const char* name, std::string& value) {
  const char* text = name ? std::getenv(name) : nullptr;
  if (!text) return -11;
  value = text;
  return 0;
}

std::string tesvEnvOrDefault(const char* name) {
  std::string value;
  if (tesvGetEnv(name, value) == 0) return value;
  const std::string key = name ? name : "";
  if (isDescriptionDirectory(key)) return TESSIVOR_DEFAULT_RESOURCE_DIR;
  if (key == "TESSIVOR_WORKING_DIR") return currentFolder();
  return {};
}

void initEnvironment() {
  EnvironmentState& s = env();
  if (s.ready) return;
  s.workingDir = tesvEnvOrDefault("TESSIVOR_WORKING_DIR");
  std::string tracing;
  s.tracing = tesvGetEnv("TESSIVOR_TRACING", tracing) == 0 && tracing.rfind("ACTIVE", 0) == 0;
  std::string workingFile;
  if (tesvGetEnv("TESSIVOR_WORKING_FILE", workingFile) != 0 || workingFile.empty())
    workingFile = "Tessivor_progress.txt";
  s.progressFile =
      workingFile.find('/') == std::string::npos ? s.workingDir + workingFile : workingFile;

  s.logPath = s.workingDir + "Process.log";
  s.log.reset(std::fopen(s.logPath.c_str(), "a"));
  if (!s.log)
    std::fprintf(stderr, "Process log not opened: %s (%s)\n", s.logPath.c_str(),
                 std::strerror(errno));
  if (s.tracing) {
    s.tracePath = s.workingDir + "Process.trace";
    std::error_code ec;
    if (fs::exists(s.tracePath, ec)) fs::rename(s.tracePath, s.tracePath + "_save", ec);
    s.trace.reset(std::fopen(s.tracePath.c_str(), "w"));
    if (!s.trace)
      std::fprintf(stderr, "Process trace not opened: %s (%s)\n", s.tracePath.c_str(),
                   std::strerror(errno));
    s.traceCerr.reset(std::fopen((s.tracePath + "_cerr.txt").c_str(), "w"));
    s.traceCout.reset(std::fopen((s.tracePath + "_cout.txt").c_str(), "w"));
  }
  const std::string catalogues = tesvEnvOrDefault("TESSIVOR_CEOS_DES_FILES_DIR");
  loadCatalogue(s.errors, catalogues + "tesv_errors_catalog.des");
  loadCatalogue(s.warnings, catalogues + "tesv_warnings_catalog.des");
  s.ready = true;
}

bool environmentReady() { return env().ready; }

const std::string& progressFilePath() { return env().progressFile; }

const std::string& workingDirectory() { return env().workingDir; }

void resetEnvironment() {
  closeLogs();
  env() = EnvironmentState{};
  phase().clear();
  waitbar_reset();
}

void setPhaseText(const std::string& text) {
  std::string value = " " + text;
  for (char& c : value)
    if (c == '\n' || c == '\r') c = ' ';
  if (value.size() > kPhaseMax) value.resize(kPhaseMax);
  phase() = value;
}

const std::string& phaseText() { return phase(); }

void logStart(const std::vector<std::string>& parameters, const std::string& title,
              const std::string& text) {
  env().runTitle = title;
  std::string banner = "\n\n\n" + kSeparatorLine + "\nSTART : " + title + "  [ " + phase() +
                       " ]\n" + dateText() + kSeparatorLine + "\n\n";
  if (!text.empty()) {
    banner += text;
  } else {
    for (std::size_t i = 0; i < parameters.size(); ++i)
      banner += " Parameter " + std::to_string(i) + " (" + parameters[i] + ")\n";
  }
  banner += kSeparatorLine + "\n\n";
  writeBoth(banner);
}

void logEnd() {
  writeBoth(kSeparatorLine + "\nEND : " + phase() + "  -  " + dateText() + "\n" + kSeparatorLine +
            "\n\n");
}

void finishRun(int code, bool writeLogs, bool closeLogsToo) {
  EnvironmentState& s = env();
  if (writeLogs) {
    if (code != 0) {
      std::string title, message;
      lookupErrorCode(code, title, message);
      logWrite("\n\n-%s   %s\n\n%s\n\nERROR :\n  %s\n\n", s.runTitle.c_str(), dateText().c_str(),
               title.c_str(), message.c_str());
    } else {
      logWrite("\n\nSUCCESSFUL\n\n%s\n\n", dateText().c_str());
    }
    logEnd();
  }
  if (writeLogs || closeLogsToo) {
    const bool hadTrace = static_cast<bool>(s.trace);
    closeLogs();
    if (code != 0 && hadTrace)
      copyQuietly(s.tracePath,
                  s.workingDir + "Tessivor_" + formattedTime("%Y%m%d_%H%M%S") + "_trace.txt");
  }
}

void traceWrite(const char* format, ...) {
  va_list args;
  va_start(args, format);
  vwrite(env().trace.get(), format, args);
  va_end(args);
}

void logWrite(const char* format, ...) {
  va_list args;
  va_start(args, format);
  vwrite(env().log.get(), format, args);
  va_end(args);
}

bool tracingActive() { return static_cast<bool>(env().trace); }

void lookupErrorCode(int code, std::string& title, std::string& message) {
  env().errors.lookup(code, title, message);
}

void lookupWarningCode(int code, std::string& title, std::string& message) {
  const EnvironmentState& s = env();
  (s.warnings.loaded() ? s.warnings : s.errors).lookup(code, title, message);
}
