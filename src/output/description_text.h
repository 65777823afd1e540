#pragma once
// The "_hdr" spelling of a description header: sections as "[Name]" lines,
// then one "name = value" line a field. Strings stand in double quotes with
// the XML entities of the five special characters; vectors and matrices
// stand in brackets; a field without value reads "IS_EMPTY". Fields made of
// sub-fields or sections have no text form and are left out.
#include <string>
#include <vector>

#include "output/description_section.h"

// Text of the sections of a tree (fields of the root first).
std::string tesv_description_text(const tesv_description_section& root);

// Writes the tree into file. Sections of an existing file that the tree does
// not hold are copied after the tree's own, so that a rewrite keeps them.
// A RasterInfo section gets its SOFTWARE field set to the running program's
// name. 0, 9 "File not opened!", 5 "File writing failed!".
int tesv_write_description_text(tesv_description_section& root, const std::string& file);

// Reads file into root (named "HEADER_INFO"). 0; 9 when the file does not
// open; 4 for a line that is not a section, a field or blank, or is longer
// than a pool buffer; error (when given) names the file and the line.
int tesv_read_description_text(const std::string& file, tesv_description_section& root,
                               std::string* error = nullptr);

// Lines of section sectionName in an existing text header, with its "[Name]"
// line, each ending in a newline, appended to text. 0; 9 when the file does
// not open; 1 when it has no such section.
int flocal_readOtherSectionFromFile(const std::string& file, const std::string& sectionName,
                                    std::string& text);

// Names of the sections of an existing text header, in file order (empty
// when it does not open).
std::vector<std::string> tesv_text_section_names(const std::string& file);
