// Every input the fuzzers once crashed, hung or exhausted a reader with is
// kept in fuzz/regressions/<entry>/ and replayed here through the same entry:
// the reader must answer with a status or an error, nothing else.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "entries.h"

namespace fs = std::filesystem;

TEST(FuzzRegressions, EveryKeptInputIsAnsweredByItsReader) {
  const fs::path root = fs::path(TESSIVOR_SOURCE_DIR) / "fuzz" / "regressions";
  int replayed = 0;
  for (const std::string& name : fuzzEntryNames()) {
    const fs::path folder = root / name;
    if (!fs::is_directory(folder)) continue;
    for (const auto& file : fs::directory_iterator(folder)) {
      std::ifstream in(file.path(), std::ios::binary);
      const std::vector<char> bytes{std::istreambuf_iterator<char>(in), {}};
      SCOPED_TRACE(file.path().string());
      EXPECT_EQ(fuzzEntry(name)(reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size()), 0);
      ++replayed;
    }
  }
  fuzzScratchRemove();
  RecordProperty("replayed", replayed);
}
