// Finishing of a job's products: final names, parameter stores, description
// headers and the GeoTIFF step.
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "base/status.h"
#include "diag/environment.h"
#include "diag/report.h"
#include "focus/sensor_registry.h"
#include "focus/sensors/palsar.h"
#include "ingest/palsar/palsar_types.h"
#include "job/focuser_handover.h"
#include "output/general_sar_kelmir.h"
#include "output/raster_to_geotiff.h"
#include "product/data_set_info.h"

namespace {

constexpr const char* kNotGiven = "NotOK";
constexpr const char* kParameterStore = ".TessivorParameterExtracted";
constexpr float kDefaultSpeed = 6900.0f;

const std::string& parameter(const std::vector<std::string>& p, std::size_t i) {
  static const std::string empty;
  return i < p.size() ? p[i] : empty;
}

void renameFile(const std::string& from, const std::string& to) {
  if (std::rename(from.c_str(), to.c_str()) != 0 && tracingActive())
    traceWrite("rename %s -> %s failed\n", from.c_str(), to.c_str());
}

void removeFile(const std::string& name) {
  if (std::remove(name.c_str()) != 0) ORV_REPORT("Cannot remove file " + name, REPORT_WARNING);
}

// Label of a PALSAR polarisation code; other codes keep the label.
void palsarLabel(int code, std::string& label) {
  static const char* labels[5] = {"hh", "hv", "vh", "vv", "1"};
  if (code >= 0 && code <= 4) label = labels[code];
}

// Label of an ENVISAT alternating-polarisation channel from its header.
std::string envisatLabel(const std::string& header) {
  DataSetInfo_Obj info;
  info.readhdr(header);
  if (info.Polarization == "H/H") return "hh";
  if (info.Polarization == "V/V") return "vv";
  if (info.Polarization == "H/V") return "hv";
  if (info.Polarization == "V/H") return "vh";
  return "1";
}

// Header export of one product with its record.
void exportHeaders(GeneralSAR_kelmir& record, const std::string& product, const std::string& second,
                   int tag) {
  int st = tag == KT_PALSAR_ERSDAC ? record.writehdr_ersdac_kelmir(product, second, kDefaultSpeed, tag)
                                   : record.writehdr_kelmir(product, second, kDefaultSpeed, tag);
  if (st != 0) ORV_REPORT_CALLED_ERROR();
}

// Sets the phase and checks the progress file before a GeoTIFF export.
void announceTiff(const std::string& phase) {
  setPhaseText(phase);
  if (!getAndSetPerc(99, 99, phase.c_str())) {
    traceWrite("\n EXECUTION INTERRUPTED BY OPERATOR\n");
    TESV_FATAL(EC_INTERRUPTED, "EXECUTION INTERRUPTED BY OPERATOR");
  }
}

void makeTiff(const std::string& source, const std::vector<std::string>& p) {
  GeoTiffRequest request = focusingGeoTiffRequest(source, std::atof(parameter(p, 23).c_str()),
                                                  std::atoi(parameter(p, 20).c_str()),
                                                  std::atoi(parameter(p, 21).c_str()));
  if (tesv_raster_to_geotiff(request) != 0) ORV_REPORT_CALLED_ERROR();
}

void finishSingleFile(const FocuserJobFields& job, const std::vector<std::string>& p) {
  const std::string& out = job.outputFilename;
  const std::string product = out + "_slc";
  renameFile(out, product);
  const std::string store = product + kParameterStore;
  GeneralSAR_kelmir record;
  record.GSread(out + ".hdr");
  renameFile(out + ".hdr", store);

  if (const SensorDriver* sensor = findSensor(parameter(p, 0))) {
    const FinishingTag tag = sensor->finishingTag(job, p);
    if (tag.tag >= 0) exportHeaders(record, product, tag.second, tag.tag);
  }
  record.GSdestroy();

  if (parameter(p, 22) == "OK") {
    announceTiff("Tiff generation ...");
    makeTiff(product, p);
  }
}

void finishAlternating(const FocuserJobFields& job, const std::vector<std::string>& p) {
  const std::string& out = job.outputFilename;
  std::string labels[2];
  for (int k = 1; k <= 2; ++k) {
    const std::string channel = out + std::to_string(k);
    removeFile(channel);
    removeFile(channel + ".hdr");
    const std::string descalloped = channel + "_descallop";
    std::string& label = labels[k - 1];
    label = envisatLabel(descalloped + ".hdr");
    const std::string product = out + "_" + label + "_slc";
    renameFile(descalloped, product);
    GeneralSAR_kelmir record;
    record.GSread(descalloped + ".hdr");
    renameFile(descalloped + ".hdr", product + kParameterStore);
    exportHeaders(record, product, job.auxFile3, KT_ENVISAT_AP);
    record.GSdestroy();
  }
  if (parameter(p, 22) == "OK") {
    announceTiff("Tiff generation (1/2)...");
    makeTiff(out + "_" + labels[0] + "_slc", p);
    announceTiff("Tiff generation (2/2)...");
    makeTiff(out + "_" + labels[1] + "_slc", p);
  }
}

void finishMultiFile(const FocuserJobFields& job, const std::vector<std::string>& p) {
  const SensorDriver* sensor = findSensor(parameter(p, 0));
  if (!sensor || !sensor->multiFileProducts) return;
  const std::string& out = job.outputFilename;
  std::string label;
  std::vector<std::string> products;
  for (int i = 0; i < 4; ++i) {
    const std::string& scene = parameter(p, static_cast<std::size_t>(1 + i));
    if (scene == kNotGiven) continue;
    PalsarTypes types(job.auxFile2, scene);
    palsarLabel(types.is_ersdac() == 1 ? types.get_ersdac_Pol(i) : types.getPol(), label);
    const std::string product = out + "_" + label + "_slc";
    moveFileSet(out + "_" + label, product, true);
    GeneralSAR_kelmir record;
    record.GSread(product + ".hdr");
    const std::string store = product + kParameterStore;
    if (std::rename((product + ".hdr").c_str(), store.c_str()) != 0) {
      if (std::remove(store.c_str()) != 0) ORV_REPORT("Cannot remove file " + store, REPORT_WARNING);
      renameFile(product + ".hdr", store);
    }
    exportHeaders(record, product, "", palsarExportTag(types));
    record.GSdestroy();
    products.push_back(product);
  }
  if (sensor->multiFileGeoTiff && parameter(p, 22) == "OK")
    for (const auto& product : products) makeTiff(product, p);
}

}  // namespace

void finishJobProducts(const JobFocuser& focuser, const std::vector<std::string>& parameters,
                       int alternatingPolarisation) {
  if (parameter(parameters, 2) != kNotGiven) {
    finishMultiFile(focuser.job, parameters);
  } else if (alternatingPolarisation == 1) {
    finishAlternating(focuser.job, parameters);
  } else {
    finishSingleFile(focuser.job, parameters);
  }
}
