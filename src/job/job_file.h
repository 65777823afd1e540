#pragma once
#include <string>
#include <vector>

// Loads the lines of a job file, one positional parameter a line. A path
// that does not exist is looked for by its file name in TESSIVOR_WORKING_DIR;
// when neither exists the run ends with 261122.
std::vector<std::string> loadParameterList(const std::string& path);

// Cuts the path at "###Tessivor###", loads the job file and drops its first
// line: element 0 of the result is line 2 of the file. A file of fewer than
// two lines ends the run with 261122.
std::vector<std::string> splitJobParameters(const std::string& path);
