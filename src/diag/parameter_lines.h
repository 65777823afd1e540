#pragma once
#include <string>
#include <vector>

// Line reader of job files and catalogues: one parameter a line, trimmed of
// blanks; a carriage return cuts its line; an empty line is an empty
// parameter; a line starting with '#' ends the list. False when the file
// cannot be opened or read.
bool readParameterLines(const std::string& path, std::vector<std::string>& lines);

// Cuts text at the first "###Tessivor###" marker.
std::string cutAtTessivorMarker(const std::string& text);
