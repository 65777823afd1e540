#pragma once
// Temporary folders and hand-written side files for the product record tests.
#include <gtest/gtest.h>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <string>

#include "product/profile.h"
#include "support/files.h"

namespace record_test {

// A fresh folder under the test temporary directory, named after the test.
inline std::string freshDir() { return support::scratchDir("record"); }

// Text of a value as parameter documents store it (15 significant digits):
// two values are equal through a document when these texts are.
inline std::string g15(double v) {
  char buffer[64];
  std::snprintf(buffer, sizeof buffer, "%.15g", v);
  return buffer;
}

// Writes text to path and drops any cached copy of it.
inline void writeText(const std::string& path, const std::string& text) {
  FreeProfile(path);
  std::ofstream(path, std::ios::binary) << text;
}

}  // namespace record_test
