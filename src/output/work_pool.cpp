// The pool of scratch buffers of the header text operations.
#include "output/work_pool.h"

#include <cerrno>
#include <cstdio>
#include <memory>
#include <string>

#include "diag/environment.h"
#include "diag/orvane_exception.h"

namespace {

struct PoolRecord {
  bool busy = false;
  std::size_t size = 0;
  std::unique_ptr<char[]> buffer;
};

PoolRecord gPool[kWorkPoolRecords];

[[noreturn]] void poolExhausted(int line) {
  const char* message = "All pools are busy";
  std::string title, text;
  lookupErrorCode(kWorkPoolBusyErrorId, title, text);
  int err = errno;
  std::fprintf(stderr, "\nERROR : %s [%s] (%s) \n %s   %s\n    FILE=%s   LINE=%d  (errno = %d)",
               message, "tesv_work_pool_take", "work pool", title.c_str(), text.c_str(), __FILE__,
               line, err);
  std::fprintf(stderr, "\n\n%s [ERROR ID : %d]\n  %s [%s]\n  %s \n\n", message,
               kWorkPoolBusyErrorId, title.c_str(), text.c_str(), "tesv_work_pool_take");
  if (environmentReady()) TESV_FATAL(kWorkPoolBusyErrorId, message);
  throw orvaneException(line, "tesv_work_pool_take", __FILE__, message);
}

}  // namespace

int tesv_work_pool_take(char** buffer, std::size_t* size) {
  for (int i = 0; i < kWorkPoolRecords; ++i) {
    PoolRecord& record = gPool[i];
    if (record.busy) continue;
    if (!record.buffer || record.size < kWorkPoolBufferSize) {
      record.buffer = std::make_unique<char[]>(kWorkPoolBufferSize);
      record.size = kWorkPoolBufferSize;
    }
    record.busy = true;
    *buffer = record.buffer.get();
    *size = record.size;
    return i;
  }
  poolExhausted(__LINE__);
}

void tesv_work_pool_release(int index) {
  if (index >= 0 && index < kWorkPoolRecords) gPool[index].busy = false;
}

int tesv_work_pool_busy() {
  int n = 0;
  for (const auto& record : gPool) n += record.busy ? 1 : 0;
  return n;
}
