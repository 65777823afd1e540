// Scratch folder of a fuzzing process: one mkdtemp folder under TMPDIR,
// reused by every input and removed when the process ends normally.
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <string>

#include "entries.h"

namespace {

std::string g_scratch;

void removeAtExit() { fuzzScratchRemove(); }

}  // namespace

const std::string& fuzzScratch() {
  if (g_scratch.empty()) {
    const char* tmp = std::getenv("TMPDIR");
    std::string pattern = std::string(tmp && *tmp ? tmp : "/tmp") + "/tessivor_fuzz_XXXXXX";
    if (!mkdtemp(pattern.data())) std::abort();
    g_scratch = pattern;
    std::atexit(removeAtExit);
  }
  return g_scratch;
}

void fuzzScratchRemove() {
  if (g_scratch.empty()) return;
  std::error_code ec;
  std::filesystem::remove_all(g_scratch, ec);
  g_scratch.clear();
}
