#pragma once
// Temporary folders and file helpers of the description-header tests.
#include <gtest/gtest.h>
#include <libxml/parser.h>
#include <libxml/xmlschemas.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>

namespace output_test {

// A fresh folder for the running test, removed by the caller's scope guard.
inline std::string freshDir() {
  const auto* info = testing::UnitTest::GetInstance()->current_test_info();
  std::filesystem::path dir = std::filesystem::path(testing::TempDir()) /
                              ("tessivor_output_" + std::to_string(getpid()) + "_" +
                               info->test_suite_name() + "_" + info->name());
  std::filesystem::remove_all(dir);
  std::filesystem::create_directories(dir);
  return dir.string() + "/";
}

struct DirGuard {
  std::string dir;
  ~DirGuard() {
    std::error_code ec;
    std::filesystem::remove_all(dir, ec);
  }
};

inline std::string readText(const std::string& file) {
  std::ifstream in(file, std::ios::binary);
  std::stringstream s;
  s << in.rdbuf();
  return s.str();
}

inline void writeText(const std::string& file, const std::string& text) {
  std::ofstream(file, std::ios::binary) << text;
}

inline std::string schemaPath() {
  return std::string(TESSIVOR_SOURCE_DIR) + "/resources/TessivorHeaderSchema_version_1.0.xsd";
}

// 0 when the document validates against the shipped schema (libxml2).
inline int validateAgainstSchema(const std::string& file) {
  xmlSchemaParserCtxtPtr parserContext = xmlSchemaNewParserCtxt(schemaPath().c_str());
  if (!parserContext) return -1;
  xmlSchemaPtr schema = xmlSchemaParse(parserContext);
  xmlSchemaFreeParserCtxt(parserContext);
  if (!schema) return -2;
  xmlSchemaValidCtxtPtr valid = xmlSchemaNewValidCtxt(schema);
  int result = xmlSchemaValidateFile(valid, file.c_str(), 0);
  xmlSchemaFreeValidCtxt(valid);
  xmlSchemaFree(schema);
  return result;
}

}  // namespace output_test
