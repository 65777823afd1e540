#pragma once
// Pieces the sensor lines of the registry share: the scene fields of a
// focuser, failure reports and the removal of temporary files.
#include <initializer_list>
#include <string>
#include <vector>

#include "focus/job_fields.h"
#include "focus/sensor_registry.h"

class stripmapGeneralFocuser;

// Scene, lines to skip and extract, and the memory of a modular focuser.
void fillScene(const FocuserJobFields& job, stripmapGeneralFocuser& focuser);

// An error report at the caller's line; returns status.
int sensorFail(const std::string& message, int status, int line, const char* function);
#define SENSOR_FAIL(message, status) sensorFail((message), (status), __LINE__, __func__)
// The call-tree report of a failed callee; returns status.
int sensorCalled(int status, int line, const char* function);
#define SENSOR_CALLED(status) sensorCalled((status), __LINE__, __func__)

// "<root><suffix>" for each suffix, in order, appended to `files`.
void appendTemporaryFiles(std::vector<TemporaryFile>& files, const std::string& root,
                          std::initializer_list<const char*> suffixes);

// The chain's temporary rasters of a single scene: chirp, extracted raw
// data and range-focused data with their headers.
std::vector<TemporaryFile> singleSceneTemporaries(const FocuserJobFields& job);

// Profile line of a sensor with one profile.
template <const char* Name>
int fixedProfile(const FocuserJobFields&, std::string& profile, int& alternating) {
  profile = Name;
  alternating = 0;
  return 0;
}
