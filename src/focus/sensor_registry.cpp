#include "focus/sensor_registry.h"

#include "focus/sensors/envisat.h"
#include "focus/sensors/ers.h"
#include "focus/sensors/palsar.h"
#include "focus/sensors/radarsat.h"

namespace {

// One line per platform string a job may name. ENVISAT and RADARSAT have
// focusers whose extractors this build lacks; PALSAR has none.
const SensorDriver* const kSensors[] = {
    &kEnvisatSensor,
    &kRadarsatSensor,
    &kErsSensor,
    &kPalsarSensor,
    &kPalsarErsdacSensor,
};

}  // namespace

const SensorDriver* findSensor(const std::string& platform) {
  for (const SensorDriver* sensor : kSensors)
    if (platform == sensor->platform) return sensor;
  return nullptr;
}
