#include "orbit/record_orbit_slots.h"

#include <memory>

#include "orbit/general_sar_orbit.h"
#include "product/general_sar_configuration.h"
#include "product/product_aggregates.h"

namespace {

class StandardOrbitSlots final : public GeneralSAROrbitSlots {
 public:
  std::unique_ptr<GeneralSAR_Base> makeStateVectors() const override {
    return std::make_unique<SAROrbitStateVectors_Obj>();
  }
  std::unique_ptr<GeneralSAR_Base> makeOrbit() const override {
    return std::make_unique<GeneralSAROrbit>();
  }
  void setLambda(GeneralSAR_Base& orbit, double lambda) const override {
    static_cast<GeneralSAROrbit&>(orbit).setLambda(lambda);
  }
  void setOrbitLookSign(GeneralSAR_Base& orbit, int sign) const override {
    static_cast<GeneralSAROrbit&>(orbit).setLookSign(sign);
  }
  void setStateVectorsLookSign(GeneralSAR_Base& sv, int sign) const override {
    static_cast<SAROrbitStateVectors_Obj&>(sv).lookSign = sign;
  }
  void destroyOrbit(GeneralSAR_Base& orbit) const override {
    static_cast<GeneralSAROrbit&>(orbit).SVDestroy();
  }
  void destroyStateVectors(GeneralSAR_Base& sv) const override { sv.destroyBuffers(); }
};

}  // namespace

const GeneralSAROrbitSlots& standardOrbitSlots() {
  static const StandardOrbitSlots slots;
  return slots;
}

GeneralSAR::GeneralSAR() : GeneralSAR(standardOrbitSlots()) {}
GeneralSAROrbit& GeneralSAR::orbit() { return static_cast<GeneralSAROrbit&>(*orbit_); }
SAROrbitStateVectors_Obj& GeneralSAR::stateVectors() {
  return static_cast<SAROrbitStateVectors_Obj&>(*stateVectors_);
}

ImageSARData_Obj::ImageSARData_Obj() : ImageSARData_Obj(standardOrbitSlots()) {}
GeneralSLCData::GeneralSLCData() : GeneralSLCData(standardOrbitSlots()) {}
GeneralSAROrbit& GeneralSLCData::orbit() { return static_cast<GeneralSAROrbit&>(*orbit_); }
RawSARData_Obj::RawSARData_Obj() : RawSARData_Obj(standardOrbitSlots()) {}
GeneralRAWData::GeneralRAWData() : GeneralRAWData(standardOrbitSlots()) {}
GeneralSAROrbit& GeneralRAWData::orbit() { return static_cast<GeneralSAROrbit&>(*orbit_); }

int EnvisatCalibrationFactors::writeFactor(const std::string& file) const {
  return writeFactor(file, standardOrbitSlots());
}
