#pragma once
// ALOS PALSAR (JAXA and ERSDAC layouts): the sensor's lines of the registry;
// the focusers are in palsar_focusers.h.
#include "focus/sensor_registry.h"

class PalsarTypes;

// Scenes of a PALSAR job: 1, or 2, 3, 4 for the last further scene given.
int palsarSceneCount(const FocuserJobFields& job);
// Leader, scene and orbit must be given; a single-polarisation product
// takes one scene, a double-polarisation one at most two (10 with the
// report otherwise).
int checkMultiPolPalsar(const FocuserJobFields& job, int sceneCount);
// Header export tag of a product of single, double or quad polarisation.
int palsarExportTag(const PalsarTypes& types);

// The registry lines of "PALSAR" and "PALSAR_ERSDAC".
extern const SensorDriver kPalsarSensor;
extern const SensorDriver kPalsarErsdacSensor;
