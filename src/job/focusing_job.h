#pragma once
#include <string>
#include <vector>

#include "job/focuser_handover.h"

// Number of positional parameters of a job (after its first line).
constexpr std::size_t kJobParameterCount = 24;

// Runs the job of a job file: parameters, profile, focuser, products.
// Returns 0 on success, 1 for an unsupported ENVISAT product or an unknown
// platform; every other failure ends the process through the fatal path.
int ftesv_main_focussing_stripmap(const std::string& jobPath);

// The 19 labelled lines of the start banner (parameters 0 to 18).
std::string jobLabelText(const std::vector<std::string>& parameters);

// Copies the job's parameters into the focuser's fields, with the ENVISAT
// rule for the auxiliary directories 2 to 4 (ceosDirectory is the value of
// TESSIVOR_CEOS_DES_FILES_DIR).
void fillFocuserFields(FocuserJobFields& fields, const std::vector<std::string>& parameters,
                       const std::string& ceosDirectory);

// Sets processingConfFilename from the platform and, for ENVISAT, the scene's
// product type. Returns 0, or 1 after reporting "File type not supported" or
// "Unknown platform".
int chooseParameterProfile(FocuserJobFields& fields, const std::string& ceosDirectory,
                           int& alternatingPolarisation);

// The whole program: the command string is argv[1]. Returns the exit status
// of a successful run; failures end the process with their code.
int stripmapFocuserEntry(int argc, char** argv);
