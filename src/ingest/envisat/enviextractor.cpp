// ENVISAT ASAR level-0 extraction tool and the headers of its rasters.
#include "ingest/envisat/enviextractor.h"

#include <cstdio>
#include <fstream>

#include "base/constants.h"
#include "base/status.h"
#include "diag/report.h"
#include "ingest/envisat/asar_aux.h"
#include "orbit/general_sar_orbit.h"
#include "product/antenna_pattern.h"
#include "product/product_aggregates.h"
#include "product/profile.h"

namespace {

#define EX_FAIL(message, status) \
  (orv_add_report((message), REPORT_ERROR, __LINE__, __func__, __FILE__), (status))
#define EX_CALLED(status) \
  (orv_add_report("Called function returned ERROR", REPORT_ERROR_CALL_TREE, __LINE__, __func__, __FILE__), (status))

void readString(const char* section, const char* key, std::string& value, const char* file) {
  std::string v;
  if (GetMyProfileString(section, key, v, file) == 0) value = v;
}
void readInt(const char* section, const char* key, int& value, const char* file) {
  int v = 0;
  if (GetMyProfileIntArray(section, key, &v, 1, file) == 0) value = v;
}

bool given(const std::string& s) { return !s.empty() && s != "NotOK"; }

int writeHeader(const std::string& output, const sarpar* p, const std::string& level0, const std::string& orbit,
                const char* description, bool scanSwath) {
  GeneralRAWData raw;
  SamplingConstants_Obj& smp = raw.sampling;
  smp.fc_hz = p->Carrier_frequency;
  smp.frg_hz = p->Sampling_frequency;
  smp.Brg_hz = p->chirpBandwidth;
  smp.Trg_s = 1.0 / p->Sampling_frequency;
  smp.prf_hz = smp.Baz_hz = p->prf;
  smp.pri_s = 1.0 / p->prf;
  smp.brf_hz = smp.bri_s = -999.0;
  smp.lambda_m = consts::kSpeedOfLight / smp.fc_hz;
  raw.pulse.PulseLength = p->pulseLength;
  raw.pulse.Bandwidth = p->chirpBandwidth;
  raw.pulse.PulseKRate = -999.0;
  raw.pulse.PulseSamplingRate = p->Sampling_frequency;
  raw.swath.Rank = p->Swath_rank;
  if (p->echoesPerBurst > 0) {
    // Alternating polarisation: a burst of each polarisation in turn.
    raw.swath.Echoes_per_burst = p->echoesPerBurst;
    raw.swath.Lines_per_burst = 2 * p->echoesPerBurst;
  }
  raw.swath.Rgate_bias = p->Range_gate_bias;

  ROI_Obj& roi = raw.roi;
  roi.FastStartTime = p->nearRangeTime;
  roi.SlowStartTime = p->Azimuth_time_reference;
  roi.FastTimeLength = p->samples / p->Sampling_frequency;
  roi.SlowTimeLength = p->lines / p->prf;
  roi.FastTimeDelta = 1.0 / p->Sampling_frequency;
  roi.SlowTimeDelta = 1.0 / p->prf;
  roi.Samples = p->samples;
  roi.Lines = p->lines;

  DataFile& df = raw.dataFile;
  df.filename = output;
  df.NrOfPixelsPerLine = p->samples;
  df.NrOfLinesPerImage = p->lines;
  df.RowPrefix = 4;
  df.CellType = FLOAT_COMPLEX;
  df.HeaderOffset = 0;
  raw.rasterName = output;

  DataSetInfo_Obj& info = raw.dataSetInfo;
  if (int st = fill_enviinfo(level0, &info); st != 0) return EX_CALLED(st);
  char swath[16];
  std::snprintf(swath, sizeof swath, scanSwath ? "SS%d" : "IS%d", p->swathNumber);
  info.Swath = swath;
  static const char* kPolarisations[4] = {"H/H", "V/V", "H/V", "V/H"};
  info.Polarization = kPolarisations[p->polarization_type & 3];
  info.Description = description;
  info.SWST_MIN = p->nearRangeTime;
  info.SWST_MAX = p->farRangeTime;
  info.SetImageType(DataSetInfo_Obj::IT_RAW_DATA);
  info.SetSensorType(DataSetInfo_Obj::ST_ASAR);
  info.SetAcqMode(scanSwath ? DataSetInfo_Obj::AM_SCANSAR : DataSetInfo_Obj::AM_STRIPMAP);
  info.SetUnitType(DataSetInfo_Obj::UT_VOLT);
  info.SetProjection(DataSetInfo_Obj::PR_SLANT_RANGE);

  GeneralSAROrbit& o = raw.orbit();
  o.setLambda(smp.lambda_m);
  if (given(orbit)) {
    AsarOrbit sv;
    if (int st = envi_orbit(orbit.c_str(), p, &sv); st != 0) return EX_CALLED(st);
    if (int st = o.SVCreate(sv.t0, sv.dt, 5); st != 0) return EX_CALLED(st);
    for (int k = 0; k < 15; ++k) o.pos[std::size_t(k)] = sv.pos[k], o.vel[std::size_t(k)] = sv.vel[k];
  }
  const int st = raw.writehdr();
  o.SVDestroy();
  if (st != 0) return EX_CALLED(st);
  return 0;
}

}  // namespace

int write_IMhdr(const std::string& output, const sarpar* p, const std::string& level0, const std::string& orbit) {
  return writeHeader(output, p, level0, orbit, "IM Level 0 data", false);
}
int write_APhdr(const std::string& output, const sarpar* p, const std::string& level0, const std::string& orbit) {
  return writeHeader(output, p, level0, orbit, "AP Level 0 data", false);
}
int write_WShdr(const std::string& output, const sarpar* p, const std::string& level0, const std::string& orbit) {
  return writeHeader(output, p, level0, orbit, "WS Level 0 data", true);
}

int write_param(const std::string& file, const sarpar* par, const extconf* conf, const std::string& level0,
                const std::string& ins, int swaths) {
  const char* s = "ExtractionParameters";
  std::vector<int> pol, swst, swstMax, pulse, chirp, rank, order, swl, noise, pri;
  std::vector<double> rgb;
  for (int k = 0; k < swaths; ++k) {
    pol.push_back(par[k].polarization_type);
    swst.push_back(par[k].SWST_code);
    swstMax.push_back(par[k].SWST_max_code);
    pulse.push_back(par[k].pulseLengthCode);
    chirp.push_back(par[k].chirpBandCode);
    rank.push_back(par[k].Swath_rank);
    swl.push_back(par[k].SWL_code);
    noise.push_back(par[k].SWL_noise_code);
    pri.push_back(par[k].PRI_code);
  }
  const std::string folder = level0.substr(0, level0.find_last_of('/') + 1);
  int st = 0;
  auto ints = [&](const char* key, const std::vector<int>& v) {
    if (st == 0) st = WriteMyProfileIntArray(s, key, v, file);
  };
  ints("polarization_type", pol);
  if (st == 0) st = WriteMyProfileString(s, "Level0_file", level0, file);
  if (st == 0) st = WriteMyProfileString(s, "ASAR_data_pathname", folder, file);
  if (st == 0) st = WriteMyProfileDouble(s, "Sampling_frequency", par[0].Sampling_frequency, file);
  if (st == 0) st = WriteMyProfileDouble(s, "Carrier_frequency", par[0].Carrier_frequency, file);
  ints("SWST_code", swst);
  ints("SWST_max_code", swstMax);
  ints("Pulse_length", pulse);
  ints("Chirp_band_code", chirp);
  if (st == 0) st = WriteMyProfileDouble(s, "Azimuth_time_reference", par[0].Azimuth_time_reference, file);
  if (st == 0) st = WriteMyProfileDouble(s, "Range_gate_bias", par[0].Range_gate_bias, file);
  ints("Swath_rank(R)", rank);
  if (st == 0) st = WriteMyProfileDouble(s, "SL_range_sampling_step", consts::kSpeedOfLight / (2.0 * par[0].Sampling_frequency), file);
  ints("SS_order", {0, 2, 4, 1, 3});
  if (st == 0) st = WriteMyProfileInt(s, "Resampl_fact", par[0].Resampl_fact, file);
  if (st == 0) st = WriteMyProfileString(s, "data_type(F_float/C_char)", "F", file);
  if (st == 0) st = WriteMyProfileInt(s, "Oversampling_factor", 1, file);
  if (st == 0) st = WriteMyProfileInt(s, "Number_of_swaths", 5, file);
  if (st == 0) st = WriteMyProfileDouble(s, "Antenna_az_length", 9.0, file);
  if (st == 0) st = WriteMyProfileDouble(s, "Antenna_Look_Direction", 1.0, file);
  ints("SWL_code", swl);
  ints("SWL_noise_code", noise);
  ints("PRI_code", pri);
  ints("Echo_samples_burst(M)", {50, 65, 55, 71, 60});
  ints("Inter_swath_gap(G)", {0, 0, 0, 0, 0});
  if (st == 0) st = WriteMyProfileDouble(s, "Ground_satellite_speed", 0.0, file);
  if (st == 0) st = WriteMyProfileDouble(s, "Satellite_geocentric_height", 0.0, file);
  if (st == 0) st = WriteMyProfileDouble(s, "Scene_centre_latitude", par[0].meanLatitude, file);
  if (st == 0) st = WriteMyProfileInt(s, "Swath_number", -1, file);
  if (st == 0) st = WriteMyProfileInt(s, "Number_of_bursts", par[0].Number_of_bursts, file);
  if (st == 0) st = WriteMyProfileInt(s, "Noise_packets", par[0].Noise_packets, file);
  if (st == 0) st = WriteMyProfileString("Paths", "Mission_Folder_Path", folder, file);
  if (st == 0) st = WriteMyProfileString("Paths", "ASA_WS0_Full_Name", level0, file);
  if (st == 0) st = WriteMyProfileString("Paths", "ASA_INS_Full_Name", ins, file);
  (void)conf;
  if (st == 0) st = SyncProfile(file);
  if (st != 0) return EX_FAIL("File writing failed! " + file, STATUS_WRITE_FAILED);
  return 0;
}

int enviextractor_conf::readpar(const char* file) {
  const char* s = "enviextractorConfiguration";
  readInt(s, "ReportLevel", ReportLevel, file);
  readString(s, "ReportFilename", ReportFilename, file);
  readInt(s, "Incore", Incore, file);
  readInt(s, "Memory", Memory, file);
  readInt(s, "Verbose", Verbose, file);
  readInt(s, "Packet_Type", Packet_Type, file);
  return 0;
}

int enviextractor_conf::checkpar() {
  if (Packet_Type < 0 || Packet_Type > 2)
    return EX_FAIL("Packet_Type must be 0 (echo), 1 (calibration) or 2 (noise)", STATUS_BAD_PARAMETER);
  return 0;
}

int enviextractor_input::readpar(const char* file) {
  const char* s = "enviextractorInput";
  readString(s, "ASA_Level0_File", ASA_Level0_File, file);
  readString(s, "ASA_INS_File", ASA_INS_File, file);
  readString(s, "ASA_XCA_File", ASA_XCA_File, file);
  readString(s, "ASA_XCH_File", ASA_XCH_File, file);
  readString(s, "Orbit_File", Orbit_File, file);
  readInt(s, "PacketsToExtract", PacketsToExtract, file);
  readInt(s, "PacketsToSkip", PacketsToSkip, file);
  return 0;
}

int enviextractor_input::checkpar() {
  if (PacketsToExtract < 0 || PacketsToSkip < 0)
    return EX_FAIL("PacketsToExtract and PacketsToSkip must be 0 or more", STATUS_BAD_PARAMETER);
  return 0;
}

int enviextractor_output::readpar(const char* file) {
  const char* s = "enviextractorOutput";
  readString(s, "OutputRawFile", OutputRawFile, file);
  readString(s, "OutputChirpFile", OutputChirpFile, file);
  readString(s, "OutputAntennaPatternFile", OutputAntennaPatternFile, file);
  return 0;
}

int enviextractor::readpar(const char* file) {
  conf.readpar(file);
  input.readpar(file);
  output.readpar(file);
  if (int st = conf.checkpar(); st != 0) return EX_CALLED(st);
  if (int st = input.checkpar(); st != 0) return EX_CALLED(st);
  return 0;
}

std::string enviextractor::outputName(int n) const { return numbered(output.OutputRawFile, n); }

std::string enviextractor::numbered(const std::string& name, int n) const {
  // The chain reads the channels of a multi-file product as "<name>1", "<name>2", ...
  if (asarModeInfo(ext.mode).files == 1) return name;
  return name + std::to_string(n + 1);
}

int enviextractor::run() {
  {
    Level0File product;
    if (int st = product.open(input.ASA_Level0_File); st != 0) return EX_CALLED(st);
    Level0Header header;
    if (int st = read_level0_header(product, &header); st != 0) return EX_CALLED(st);
    ext.mode = header.mode;
  }
  ext.skip = input.PacketsToSkip;
  ext.extract = input.PacketsToExtract;
  ext.packetType = conf.Packet_Type;
  ExtractionFiles files{input.ASA_Level0_File, input.ASA_INS_File, input.ASA_XCA_File, {}};
  for (int n = 0; n < asarModeInfo(ext.mode).files; ++n) files.outputs.push_back(outputName(n));
  if (int st = envi_extract(files, par, &ext, &swaths); st != 0) return EX_CALLED(st);

  for (int n = 0; n < swaths; ++n) {
    const std::string raster = outputName(n);
    int st = 0;
    if (ext.mode == ASAR_WS || ext.mode == ASAR_GM)
      st = write_WShdr(raster, &par[n], input.ASA_Level0_File, input.Orbit_File);
    else if (isApMode(ext.mode))
      st = write_APhdr(raster, &par[n], input.ASA_Level0_File, input.Orbit_File);
    else
      st = write_IMhdr(raster, &par[n], input.ASA_Level0_File, input.Orbit_File);
    if (st != 0) return EX_CALLED(st);
  }

  // Elevation antenna pattern of each swath.
  if (given(output.OutputAntennaPatternFile) && ext.mode != ASAR_WS && ext.mode != ASAR_GM) {
    for (int n = 0; n < swaths; ++n) {
      RangePattern pattern;
      if (int st = envi_rgpattern(input.ASA_XCA_File.c_str(), input.ASA_INS_File.c_str(), &par[n], &pattern);
          st != 0)
        return EX_CALLED(st);
      AntennaPattern_Obj antenna;
      antenna.PatternSamples = kPatternPoints;
      if (int st = antenna.createBuffers(); st != 0) return EX_CALLED(st);
      antenna.Pattern = pattern.gain;
      antenna.StartAngle = pattern.firstAngle;
      antenna.DeltaAngle = pattern.step;
      antenna.patternFile.filename = numbered(output.OutputAntennaPatternFile, n);
      if (int st = antenna.WritePatternArray(); st != 0) return EX_CALLED(st);
      if (int st = antenna.writehdr(); st != 0) return EX_CALLED(st);
      ROI_Obj roi;
      roi.FastStartTime = pattern.firstAngle;
      roi.FastTimeDelta = pattern.step;
      roi.FastTimeLength = 201.0 * pattern.step;
      roi.Samples = kPatternPoints;
      roi.Lines = 1;
      roi.SlowTimeDelta = roi.SlowTimeLength = 1.0;
      roi.write_roi(antenna.patternFile.filename + ".hdr", "ROI");
      SyncProfile(antenna.patternFile.filename + ".hdr");
    }
  }

  // Synthetic chirp of each swath.
  if (given(output.OutputChirpFile)) {
    for (int n = 0; n < swaths; ++n) {
      const std::string name = numbered(output.OutputChirpFile, n);
      std::vector<fcomplex> chirp;
      if (int st = envi_syntchirp(&par[n], &chirp); st != 0) return EX_CALLED(st);
      std::ofstream out(name, std::ios::binary | std::ios::trunc);
      out.write(reinterpret_cast<const char*>(chirp.data()), std::streamsize(chirp.size() * sizeof(fcomplex)));
      if (!out) return EX_FAIL("File writing failed! " + name, STATUS_WRITE_FAILED);
      out.close();
      DataFile raster(name);
      raster.NrOfPixelsPerLine = static_cast<int>(chirp.size());
      raster.NrOfLinesPerImage = 1;
      raster.RowPrefix = 0;
      raster.CellType = FLOAT_COMPLEX;
      if (int st = raster.write_hdr(); st != 0) return EX_CALLED(st);
      SARPulse_Obj pulse;
      pulse.PulseLength = par[n].pulseLength;
      pulse.Bandwidth = par[n].chirpBandwidth;
      pulse.PulseSamplingRate = par[n].Sampling_frequency;
      pulse.writehdr(name + ".hdr");
      SyncProfile(name + ".hdr");
    }
    ORV_REPORT("Synthetic Chirp Extracted", REPORT_CHECKPOINT);
  }
  return 0;
}
