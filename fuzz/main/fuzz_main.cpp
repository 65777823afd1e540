// libFuzzer executable of one reader entry (TESSIVOR_FUZZ_ENTRY).
#include <cstdlib>

#include "entries.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  static const FuzzEntry entry = fuzzEntry(TESSIVOR_FUZZ_ENTRY);
  if (!entry) std::abort();
  return entry(data, size);
}
