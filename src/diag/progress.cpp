// Progress protocol with the host: the progress file holds the percentage on
// line 1 and a message on line 2; a number above 100 written by the host is
// the operator's stop. The waitbar calls of long loops go through it.
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <string>
#include <thread>

#include "base/status.h"
#include "diag/environment.h"
#include "diag/waitbar.h"

namespace {

constexpr std::size_t kMessageMax = 1026;
constexpr int kAttempts = 10;
constexpr int kOpenWaitLimitMs = 3000;
constexpr int kCreateWaitLimitMs = 10000;

int g_percentage = 0;  // percentage on record of the waitbar

void sleepMs(int ms) {
  if (ms > 0) std::this_thread::sleep_for(std::chrono::milliseconds(ms));
}

bool fileExists(const std::string& path) {
  std::error_code ec;
  return std::filesystem::exists(path, ec);
}

// Reads the percentage of line 1; false with the stream's state traced when
// it cannot be read.
bool readPercentage(FILE* file, int& percentage, int attempt, const std::string& path) {
  if (std::fscanf(file, "%i", &percentage) == 1) return true;
  const char* state = std::ferror(file) ? "| A severe I/O error or unknown state"
                      : std::feof(file) ? "End of file reached "
                                        : "| A possibly recoverable formatting or conversion error ";
  traceWrite("getAndSetPerc - attempt %d reading %s %s\n", attempt + 1, path.c_str(), state);
  return false;
}

// Message of line 2, without its line end, at most 1026 characters.
std::string readMessage(FILE* file) {
  int c;
  while ((c = std::fgetc(file)) != EOF && c != '\n') {
  }
  char buffer[kMessageMax + 1] = {};
  if (!std::fgets(buffer, sizeof buffer, file)) return {};
  std::string message = buffer;
  while (!message.empty() && (message.back() == '\n' || message.back() == '\r')) message.pop_back();
  return message;
}

void writeProgress(FILE* file, int percentage, const std::string& message) {
  std::string text = message.substr(0, kMessageMax);
  for (char& ch : text)
    if (ch == '\n' || ch == '\r') ch = ' ';
  std::fprintf(file, "%i\n%s\n", percentage, text.c_str());
  std::fflush(file);
}

bool stopRequested(const std::string& path) {
  FILE* file = std::fopen(path.c_str(), "r");
  if (!file) return false;
  int percentage = 0;
  bool stop = std::fscanf(file, "%i", &percentage) == 1 && percentage > 100;
  std::fclose(file);
  return stop;
}

[[noreturn]] void operatorStop() {
  traceWrite("\n EXECUTION INTERRUPTED BY OPERATOR\n");
  TESV_FATAL(EC_INTERRUPTED, "EXECUTION INTERRUPTED BY OPERATOR");
}

}  // namespace

bool getAndSetPerc(int oldPercentage, int newPercentage, const char* message) {
  if (!environmentReady()) return true;
  const std::string& path = progressFilePath();
  if (oldPercentage == newPercentage) return !stopRequested(path);
  if (newPercentage > 99) newPercentage = 99;

  const std::string batchOk = path + "_batch_ok";
  ::chmod(batchOk.c_str(), 0700);
  std::remove(batchOk.c_str());

  if (fileExists(path)) {
    for (int attempt = 0, waitMs = 0; attempt < kAttempts; ++attempt, waitMs += 1000) {
      if (waitMs > kOpenWaitLimitMs) break;
      sleepMs(waitMs);
      FILE* file = std::fopen(path.c_str(), "r+");
      if (!file) {
        traceWrite("getAndSetPerc - attempt %d opening %s : %s\n", attempt + 1, path.c_str(),
                   std::strerror(errno));
        continue;
      }
      int percentage = 0;
      if (!readPercentage(file, percentage, attempt, path)) {
        std::fclose(file);
        continue;
      }
      const std::string oldMessage = readMessage(file);
      if (percentage > 100) {
        std::fclose(file);
        return false;
      }
      std::rewind(file);
      writeProgress(file, newPercentage, message ? std::string(message) : oldMessage);
      long length = std::ftell(file);
      if (length >= 0 && ::ftruncate(::fileno(file), length) != 0)
        traceWrite("getAndSetPerc - cannot shorten %s : %s\n", path.c_str(), std::strerror(errno));
      std::fclose(file);
      return true;
    }
    TESV_FATAL(EC_INTERRUPTED, "progress file cannot be read: " + path);
  }

  traceWrite("getAndSetPerc - Not found the file : %s\n", path.c_str());
  for (int waitMs = 0; waitMs < kCreateWaitLimitMs; waitMs += 1000) {
    sleepMs(waitMs);
    FILE* file = std::fopen(path.c_str(), "w");
    if (!file) continue;
    writeProgress(file, newPercentage, message ? message : "");
    std::fclose(file);
    return true;
  }
  TESV_FATAL(EC_INTERRUPTED, "progress file cannot be created: " + path);
}

int waitbar_open(const char* message) {
  setPhaseText(message ? message : "");
  // An impossible old value makes the current percentage and the message
  // reach the file.
  if (!getAndSetPerc(-1, g_percentage, phaseText().c_str())) operatorStop();
  return 0;
}

int waitbar_update(int /*unused*/, float percentage) {
  int value = percentage >= 100.0f ? 100 : static_cast<int>(percentage);
  if (value == g_percentage) return 0;
  if (!getAndSetPerc(g_percentage, value, nullptr)) operatorStop();
  g_percentage = value;
  if (environmentReady() && ::isatty(STDERR_FILENO))
    std::fprintf(stderr, "\r%-60.60s %3d%%%s", phaseText().c_str(), value, value >= 100 ? "\n" : "");
  return 0;
}

int waitbar_close() { return 0; }

void waitbar_reset() { g_percentage = 0; }
