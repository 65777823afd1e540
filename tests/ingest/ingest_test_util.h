#pragma once
// Temporary folders and hand-made files for the ingest tests.
#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "support/files.h"

namespace ingest_test {

using support::TempFolder;
inline void writeBytes(const std::string& path, const std::string& bytes) { support::writeText(path, bytes); }

// Bytes of size n, blank, with text put at offset.
inline std::string blankWith(std::size_t n, std::initializer_list<std::pair<std::size_t, std::string>> fields) {
  std::string s(n, ' ');
  for (const auto& [offset, text] : fields) s.replace(offset, text.size(), text);
  return s;
}

// The head of an ENVISAT product main header whose PRODUCT value is name,
// with sensing start and stop as the MPH places them.
inline std::string mphHead(const std::string& name, const std::string& start = "01-JAN-2007 00:00:00.000000",
                           const std::string& stop = "01-JAN-2007 00:00:10.000000") {
  std::string s = "PRODUCT=\"" + name;
  s.resize(73, ' ');
  s += "\"\n";
  s.resize(336, ' ');
  s += "SENSING_START=\"" + start + "\"\nSENSING_STOP=\"" + stop + "\"\n";
  s.resize(1247, ' ');
  return s;
}

using support::realData;
using support::realDataPresent;

}  // namespace ingest_test
