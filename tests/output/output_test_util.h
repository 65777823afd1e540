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

#include "support/files.h"

namespace output_test {

using support::readText;
using support::writeText;

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
