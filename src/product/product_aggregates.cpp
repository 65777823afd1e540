#include "product/product_aggregates.h"

#include <algorithm>
#include <cmath>

#include "base/constants.h"
#include "base/status.h"
#include "diag/report.h"

namespace {

// File name less its extension (the part from the last '.' after the last
// '/').
std::string withoutExtension(const std::string& file) {
  const auto slash = file.find_last_of('/');
  const auto dot = file.find_last_of('.');
  if (dot == std::string::npos || (slash != std::string::npos && dot < slash)) return file;
  return file.substr(0, dot);
}

}  // namespace

// ---- ImageSARData_Obj / GeneralSLCData ----------------------------------------

ImageSARData_Obj::ImageSARData_Obj(const GeneralSAROrbitSlots& slots)
    : ImageSARData_Obj(slots, false) {}

ImageSARData_Obj::ImageSARData_Obj(const GeneralSAROrbitSlots& slots, bool fullOrbit)
    : slots_(&slots),
      fullOrbit_(fullOrbit),
      orbit_(fullOrbit ? slots.makeOrbit() : slots.makeStateVectors()) {}

ImageSARData_Obj::~ImageSARData_Obj() = default;

int ImageSARData_Obj::readMembers(const std::string& file, bool stopAtFailure) {
  rasterName = withoutExtension(file);
  dataFile.filename = rasterName;
  int status = dataFile.read_hdr(rasterName);
  if (status != 0) return status;
  status = roi.read_roi(file, "ROI");
  if (status != 0) return status;
  GeneralSAR_Base* members[] = {&sampling,    orbit_.get(),     &dataSetInfo,
                                &attitude,    &polynomials,     &spectralWindows,
                                &geoCoords,   &pulse,           &swath};
  for (GeneralSAR_Base* m : members) {
    status = m->readhdr(file);
    if (status != 0 && stopAtFailure) return status;
  }
  return 0;
}

int ImageSARData_Obj::readhdr(const std::string& file) { return readMembers(file, true); }

int GeneralSLCData::readhdr(const std::string& file) { return readMembers(file, false); }

int ImageSARData_Obj::writehdr() {
  const std::string hdr = rasterName + ".hdr";
  dataFile.filename = rasterName;
  int status = dataFile.write_hdr();
  if (status != 0) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  roi.write_roi(hdr, "ROI");
  GeneralSAR_Base* members[] = {&sampling,  orbit_.get(), &dataSetInfo, &attitude, &polynomials,
                                &spectralWindows, &geoCoords, &pulse, &swath};
  for (GeneralSAR_Base* m : members) m->writehdr(hdr);
  return 0;
}

int ImageSARData_Obj::destroyAll() {
  if (fullOrbit_)
    slots_->destroyOrbit(*orbit_);
  else
    slots_->destroyStateVectors(*orbit_);
  polynomials.DestroyPolys();
  return 0;
}

int ImageSARData_Obj::compute_eqspeed() {
  if (polynomials.FR.empty() || polynomials.DC.empty()) {
    ORV_REPORT("NO FR poly available", REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  const double c = consts::kSpeedOfLight;
  const double lambda = c / sampling.fc_hz;
  const double T = dataFile.NrOfPixelsPerLine / sampling.frg_hz;
  const double t0 = roi.FastStartTime;
  const double t1 = t0 + roi.FastTimeLength;
  const poly& fr = polynomials.FR[0];
  const auto ka = [&](double t) {
    const double x = t - fr.trg0;
    return fr.c[0] + fr.c[1] * x + fr.c[4] * x * x;
  };
  const double k0 = ka(t0);
  const double k1 = ka(t1);
  double fdc = 0.0;
  polynomials.EvaluateDC((t0 + t1) * 0.5, polynomials.DC[0].taz0, &fdc);
  const double u = lambda * fdc * 0.5;
  const double v = std::sqrt(lambda * (74948114.5 / (1.0 / k0 - 1.0 / k1)) * T + u * u);
  attitude.Eq_speed = v;
  attitude.Eq_distance = -(std::cos(std::asin(u / v)) * T * c * 0.5) / (1.0 - k0 / k1);
  return 0;
}

GeneralSLCData::GeneralSLCData(const GeneralSAROrbitSlots& slots)
    : ImageSARData_Obj(slots, true) {}

// ---- RawSARData_Obj / GeneralRAWData ----------------------------------------------

RawSARData_Obj::RawSARData_Obj(const GeneralSAROrbitSlots& slots) : RawSARData_Obj(slots, false) {}

RawSARData_Obj::RawSARData_Obj(const GeneralSAROrbitSlots& slots, bool fullOrbit)
    : slots_(&slots),
      fullOrbit_(fullOrbit),
      orbit_(fullOrbit ? slots.makeOrbit() : slots.makeStateVectors()) {}

RawSARData_Obj::~RawSARData_Obj() = default;

int RawSARData_Obj::readMembers(const std::string& file, bool stopAtFailure) {
  rasterName = withoutExtension(file);
  dataFile.filename = rasterName;
  int status = dataFile.read_hdr(rasterName);
  if (status != 0) return status;
  status = roi.read_roi(file, "ROI");
  if (status != 0) return status;
  GeneralSAR_Base* members[] = {&sampling, orbit_.get(), &dataSetInfo, &pulse, &swath, &attitude};
  for (GeneralSAR_Base* m : members) {
    status = m->readhdr(file);
    if (status != 0 && stopAtFailure) return status;
  }
  return 0;
}

int RawSARData_Obj::readhdr(const std::string& file) { return readMembers(file, true); }

int GeneralRAWData::readhdr(const std::string& file) { return readMembers(file, false); }

int RawSARData_Obj::writehdr() {
  const std::string hdr = rasterName + ".hdr";
  dataFile.filename = rasterName;
  int status = dataFile.write_hdr();
  if (status != 0) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  roi.write_roi(hdr, "ROI");
  GeneralSAR_Base* members[] = {&sampling, orbit_.get(), &dataSetInfo, &pulse, &swath, &attitude};
  for (GeneralSAR_Base* m : members) m->writehdr(hdr);
  return 0;
}

int RawSARData_Obj::destroyAll() {
  if (fullOrbit_)
    slots_->destroyOrbit(*orbit_);
  else
    slots_->destroyStateVectors(*orbit_);
  return 0;
}

GeneralRAWData::GeneralRAWData(const GeneralSAROrbitSlots& slots) : RawSARData_Obj(slots, true) {}

// ---- processed bandwidth ------------------------------------------------------------

int GetProcessedBandwidth(const SamplingConstants_Obj& sampling, const SpectralWindows_Obj& windows,
                          double* range, double* azimuth) {
  *range = windows.RgMatchedFilterCoef == 0.0 ? sampling.Brg_hz
                                              : std::min(windows.RgLookBandwidth, sampling.Brg_hz);
  *azimuth = windows.AzMatchedFilterCoef == 0.0
                 ? sampling.Baz_hz
                 : std::min(windows.AzLookBandwidth, sampling.Baz_hz);
  return 0;
}

int GetProcessedBandwidth(const SamplingConstants_Obj* sampling,
                          const SpectralWindows_Obj* windows, double* range, double* azimuth) {
  return GetProcessedBandwidth(*sampling, *windows, range, azimuth);
}
