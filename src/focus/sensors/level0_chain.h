#pragma once
// Chain set-up shared by the focusers of single level-0 scenes.
#include <string>

#include "focus/sar_focuser.h"

struct FocuserWork;

// Profile Memory of section "sarfocuserConfiguration" (256 when absent) and
// the chain's configuration read from the profile with the fixed values of
// single scenes. `announceDefault` reports the default at level 1.
int configureLevel0Chain(SARFocuser_conf& conf, const std::string& profile, bool announceDefault);

// Names the stage rasters of a scene whose products start with `root`
// ("<root>.extracted", ".chirp", ".rgfoc", the antenna pattern
// "<root><antennaSuffix>" or none when the suffix is empty) and hands them to
// the chain, which reads the antenna pattern only when `chainUsesAntenna`.
void nameLevel0Stages(FocuserWork& work, SARFocuser& chain, const std::string& root,
                      const std::string& antennaSuffix, bool chainUsesAntenna);

// Records of the extracted rasters into the work object (the antenna's only
// with `withAntenna`).
int readWorkRecords(FocuserWork& work, bool withAntenna);

// The call-tree report; returns status.
int level0CalledError(int status);
