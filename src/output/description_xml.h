#pragma once
// The ".sml" spelling of a description header: XML written as text and read
// back through the expat stream parser.
#include <string>
#include <utility>
#include <vector>

#include "output/description_section.h"

// Namespace of the product headers and the schema file it names.
inline constexpr const char* kHeaderSchemaNamespace =
    "http://schemas.tessivor.org/xml/TessivorHeaderSchema";
inline constexpr const char* kHeaderSchemaFile = "TessivorHeaderSchema_version_1.0.xsd";

// One element as the parser delivered it.
struct tesv_xml_node {
  std::string tag;
  std::vector<std::pair<std::string, std::string>> attributes;
  std::string text;  // character data of the element itself
  std::vector<tesv_xml_node> children;

  const tesv_xml_node* child(const std::string& name) const;
  const std::string* attribute(const std::string& name) const;
};

// Runs expat over a whole document. 0 with the root element filled, or 1
// with the parser's message and position in error ("mismatched tag at line
// 3, column 2").
int ftesv_xml_parser(const std::string& document, tesv_xml_node& root, std::string& error);

// The five characters written as entities.
std::string tesv_xml_escape(const std::string& text);
// Back from the program's own temporary escapes ("##quot", "##apos",
// "##amp", "##lt", "##gt"); "####BIG" is dropped.
std::string tesv_decode_temporary_escapes(const std::string& text);

// Name of the running program (the SOFTWARE field of RasterInfo).
std::string tesv_program_name();

// The document of a tree. A root named with "HEADER_INFO" gets the
// namespace and schema location; a RasterInfo section gets its SOFTWARE field
// set to the running program's name first.
std::string tesv_description_xml_text(tesv_description_section& root);
// Writes the document into file: 0, 9 "File not opened!", 5 "File writing
// failed!".
int tesv_write_description_xml(tesv_description_section& root, const std::string& file);

// Reads file into root. The root element must be initialTag (or hold
// "PARAMETERS_INFO_" when initialTag does). 0; 9 when the file does not
// open; 4 with the parser's message for a document that is not well-formed;
// 1 when the root tag is not the expected one or the content is not a
// header tree. error (when given) receives the message.
int tesv_read_description_xml(const std::string& file, tesv_description_section& root,
                              const std::string& initialTag = "HEADER_INFO",
                              std::string* error = nullptr);
// The same from a document in memory.
int tesv_parse_description_xml(const std::string& document, tesv_description_section& root,
                               const std::string& initialTag = "HEADER_INFO",
                               std::string* error = nullptr);
