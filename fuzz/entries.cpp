// One entry a reader of outside input: the bytes become the file (or text)
// the reader is given, and the reader runs as the chain calls it. Statuses
// and exceptions are the readers' answers to bad input and are ignored here;
// a crash, a sanitizer report, a hang or an exhausted memory is the finding.
#include "entries.h"

#include <unistd.h>

#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <map>
#include <string>
#include <vector>

#include "diag/parameter_lines.h"
#include "ingest/envisat/asar_aux.h"
#include "ingest/envisat/asar_level0.h"
#include "ingest/ers/ers_extractor.h"
#include "ingest/ers/ers_types.h"
#include "ingest/palsar/palsar_extractor.h"
#include "ingest/palsar/palsar_types.h"
#include "ingest/radarsat/radarextract.h"
#include "job/focusing_job.h"
#include "job/job_file.h"
#include "orbit/deos_orbit.h"
#include "orbit/doris_orbit.h"
#include "orbit/orbit_files.h"
#include "orbit/palsar_orbit.h"
#include "orbit/radarsat_orbit.h"
#include "output/description_section.h"
#include "output/description_text.h"
#include "output/description_xml.h"
#include "product/data_set_info.h"
#include "product/orvane_xml.h"
#include "product/profile.h"
#include "product/raster_info.h"
#include "product/roi.h"

namespace {

std::string scratchPath(const std::string& name) { return fuzzScratch() + "/" + name; }

// Writes the bytes to the named scratch file (replacing what it held).
std::string put(const std::string& name, const std::uint8_t* data, std::size_t size) {
  const std::string path = scratchPath(name);
  std::ofstream out(path, std::ios::binary | std::ios::trunc);
  out.write(reinterpret_cast<const char*>(data), static_cast<std::streamsize>(size));
  return path;
}

std::string text(const std::uint8_t* data, std::size_t size) {
  return std::string(reinterpret_cast<const char*>(data), size);
}

// Inputs of two files: a 4-byte little-endian length of the first, the
// first, then the second.
bool splitPair(const std::uint8_t* data, std::size_t size, std::string& first, std::string& second) {
  if (size < 4) return false;
  const std::size_t n = std::size_t(data[0]) | std::size_t(data[1]) << 8 |
                        std::size_t(data[2]) << 16 | std::size_t(data[3]) << 24;
  if (n > size - 4) return false;
  first = text(data + 4, n);
  second = text(data + 4 + n, size - 4 - n);
  return true;
}

std::string putText(const std::string& name, const std::string& bytes) {
  return put(name, reinterpret_cast<const std::uint8_t*>(bytes.data()), bytes.size());
}

// Runs a reader; its statuses and exceptions are answers, not findings.
template <class F>
int guarded(F&& f) {
  try {
    f();
  } catch (...) {
  }
  FreeProfile();
  return 0;
}

// Genuine instrument files, when the mission files are at hand.
std::string realFile(const char* relative) {
#ifdef TESSIVOR_REALDATA_DIR
  const std::string path = std::string(TESSIVOR_REALDATA_DIR) + "/" + relative;
  if (std::filesystem::exists(path)) return path;
#endif
  (void)relative;
  return {};
}

// ---- job files and command strings ------------------------------------------

int jobFile(const std::uint8_t* data, std::size_t size) {
  return guarded([&] {
    const std::string path = put("job", data, size);
    cutAtTessivorMarker(text(data, size));
    std::vector<std::string> parameters = splitJobParameters(path + "###Tessivor###tail");
    if (parameters.size() >= kJobParameterCount) {
      jobLabelText(parameters);
      FocuserJobFields fields;
      fillFocuserFields(fields, parameters, fuzzScratch() + "/");
    }
  });
}

// ---- profiles, parameter documents, description headers -----------------------

int profileFile(const std::uint8_t* data, std::size_t size) {
  return guarded([&] {
    const std::string path = put("profile.hdr", data, size);
    std::string s;
    std::vector<std::string> strings;
    std::vector<int> ints;
    std::vector<double> doubles;
    std::vector<float> floats;
    std::vector<int64_t> longs;
    for (const char* section : {"RasterInfo", "Parameters", "S", ""}) {
      for (const char* key : {"NrOfPixelsPerLine", "CellType", "Memory", "k", ""}) {
        GetMyProfileString(section, key, s, path);
        GetMyProfileStringArray(section, key, strings, 3, 0, path);
        GetMyProfileIntArray(section, key, ints, 4, path);
        GetMyProfileInt64Array(section, key, longs, 2, path);
        GetMyProfileFloatArray(section, key, floats, 3, path);
        GetMyProfileDoubleArray(section, key, doubles, 5, path);
      }
    }
    WriteMyProfileString("S", "k", "v", path);
    WriteMyProfileDoubleArray("S", "d", std::vector<double>{1.5, -2.0}, path);
    DelProfileKey("S", "k", path);
    DelProfileSection("RasterInfo", path);
    SyncProfile(path);
    FreeProfile(path);
    GetMyProfileDoubleArray("S", "d", doubles, 2, path);
  });
}

int parameterStore(const std::uint8_t* data, std::size_t size) {
  return guarded([&] {
    const std::string path = put("params.hdr", data, size);
    ATERSExtractor extractor;
    if (extractor.readpar(path, 0) == 0) extractor.checkpar();
    ATPalExtractor palsar;
    if (palsar.readpar(path, 1) == 0) palsar.checkpar();
  });
}

int xmlDocument(const std::uint8_t* data, std::size_t size) {
  return guarded([&] {
    const std::string path = put("params.xml", data, size);
    orvanexml doc;
    if (doc.initXmlFile(path) != 0) return;
    int i[4] = {};
    double d[4] = {};
    float f[4] = {};
    std::string s[2];
    for (int channel = 0; channel < 3; ++channel) {
      for (const char* p : {"Tool/Memory", "Tool/Coeffs", "Other/Names", "a/b/c", "/", "", "*"}) {
        doc.readInt(channel, p, i, 4);
        doc.readDouble(channel, p, d, 4);
        doc.readFloat(channel, p, f, 4);
        doc.readString(channel, p, s, 2);
        doc.countNodes(channel, p);
      }
    }
    doc.writeInt(0, "Tool/Memory", i, 1);
    doc.removeNodes(1, "Other/Names");
  });
}

int descriptionText(const std::uint8_t* data, std::size_t size) {
  return guarded([&] {
    const std::string path = put("product_hdr", data, size);
    tesv_description_section root;
    if (tesv_read_description_text(path, root) == 0) tesv_description_text(root);
    tesv_text_section_names(path);
    std::string section;
    for (const std::string& name : descriptionSectionNames())
      flocal_readOtherSectionFromFile(path, name, section);
    RasterInfoLayout layout;
    read_raster_info_profile(path, layout);
  });
}

int descriptionXml(const std::uint8_t* data, std::size_t size) {
  return guarded([&] {
    const std::string document = text(data, size);
    tesv_xml_node node;
    std::string error;
    ftesv_xml_parser(document, node, error);
    tesv_description_section root;
    if (tesv_parse_description_xml(document, root, "HEADER_INFO", &error) == 0)
      tesv_description_xml_text(root);
  });
}

// ---- ERS CEOS -------------------------------------------------------------------

int ersLeader(const std::uint8_t* data, std::size_t size) {
  return guarded([&] {
    std::filesystem::create_directories(scratchPath("ers"));
    put("ers/LEA_01.001", data, size);
    ErsTypes types(scratchPath("ers"));
    types.is_ers1();
    types.is_ers2();
    types.is_level0();
    types.find_type();
    ROI_Obj roi;
    types.read_roi(&roi);
    ATERSExtractor extractor;
    extractor.LeaFilename = scratchPath("ers/LEA_01.001");
    extractor.readLeader();
  });
}

int ersImage(const std::uint8_t* data, std::size_t size) {
  return guarded([&] {
    std::string leader, image;
    if (!splitPair(data, size, leader, image)) return;
    ATERSExtractor extractor;
    extractor.LeaFilename = putText("ers_leader", leader);
    extractor.ImgFilename = putText("ers_image", image);
    extractor.OutputFile = scratchPath("ers_raw");
    if (extractor.readLeader() == 0) extractor.readImage();
  });
}

// ---- ENVISAT --------------------------------------------------------------------

int asarLevel0(const std::uint8_t* data, std::size_t size) {
  return guarded([&] {
    const std::string path = put("ASA_IM__0P", data, size);
    Level0File file;
    if (file.open(path) != 0) return;
    Level0Header header;
    read_level0_header(file, &header);
    for (long offset = kFirstPacketOffset; file.has(offset, kPacketHeadBytes);) {
      const PacketHead head = parse_packet_head(file.data() + offset);
      checkheader(head, header.mode < 0 ? 0 : header.mode);
      if (head.packetBytes() <= 0) break;
      offset += head.packetBytes();
    }
    synchromdsr(file, kFirstPacketOffset, header.mode < 0 ? 0 : header.mode);
    double t0 = 0.0;
    extract_t0(path, &t0);
    DataSetInfo_Obj info;
    fill_enviinfo(path, &info);
    const std::string ins = realFile("envisat_aux/ASA_INS_AXVIEC20091217_114637_20090428_100000_20101231_235959");
    if (ins.empty() || header.mode < 0) return;
    sarpar par[8];
    int swaths = 0;
    if (loadparam(file, ins.c_str(), header.mode, par, &swaths) != 0) return;
    Timeline table;
    init_IM_table(file, header.mode, par, &table);
  });
}

// INS, XCA and XCH files: the first byte chooses the reader.
int asarAux(const std::uint8_t* data, std::size_t size) {
  return guarded([&] {
    if (size < 1) return;
    const int which = data[0] % 4;
    const std::string path = put("ASA_AUX", data + 1, size - 1);
    const char* p = path.c_str();
    std::vector<float> q(kFbaqLevels * kFbaqCodes), i(kFbaqLevels * kFbaqCodes);
    std::vector<float> fn(64 * 7 * 2), gn(64 * 2), gain(64);
    sarpar par[8];
    int codes[8] = {1, 2, 3, 4, 5, 6, 7, 1};
    float value = 0.0f;
    RangePattern pattern;
    switch (which) {
      case 0:  // instrument characterisation
        LUTfbaq_f(p, q.data(), i.data());
        getDROOPgain(p, gain.data(), int(gain.size()));
        for (int mode = 0; mode < 4; ++mode) asainspar(p, par, mode, codes, mode == 0 ? 1 : 5);
        break;
      case 1:  // external calibration
        for (int pol = 0; pol < 4; ++pol) xca_pattern_db(p, pol, 1 + pol, 17 * pol, &value);
        par[0].swathNumber = 2;
        envi_rgpattern(p, p, par, &pattern);
        break;
      case 2:  // external characterisation
        gen_fn_v2(p, p, fn.data(), gn.data(), 0);
        gen_fn(p, p, fn.data(), gn.data(), 1);
        break;
      default: {  // DORIS orbit of an ENVISAT scene
        AsarOrbit orbit;
        par[0].Azimuth_time_reference = 730944000.0;
        envi_orbit(p, par, &orbit);
      }
    }
  });
}

// ---- orbits ---------------------------------------------------------------------

int deosOrbit(const std::uint8_t* data, std::size_t size) {
  return guarded([&] {
    const std::string path = put("ODR.001", data, size);
    OrbitRecords records;
    std::string satellite;
    if (read_deos_odr(path, records, &satellite) != 0 || records.size() == 0) return;
    double pos[3 * 5] = {};
    const double mid = records.times[records.size() / 2];
    interp_orb_deos(path, mid, satellite, mid - 10.0, 5.0, 5, pos);
    interp_orb_deos(path, mid, "ERS-1", mid, 1.0, 1, pos);
  });
}

int dorisOrbit(const std::uint8_t* data, std::size_t size) {
  return guarded([&] {
    const std::string path = put("DOR_VOR_AX", data, size);
    OrbitRecords records;
    get_state_vectors(path, -1e12, 1e12, records);
    double pos[15] = {}, vel[15] = {};
    int orbit = 0;
    double node = 0.0;
    const double t = records.size() > 0 ? records.times[records.size() / 2] : 730944000.0;
    interp_orb_l(path, t, 5, 10.0, pos, vel, &orbit, 1, &node);
  });
}

// ---- PALSAR and RADARSAT CEOS ----------------------------------------------------------

int palsarCeos(const std::uint8_t* data, std::size_t size) {
  return guarded([&] {
    std::string leader, image;
    if (!splitPair(data, size, leader, image)) return;
    const std::string lea = putText("LED-ALPSR", leader);
    const std::string img = putText("IMG-HH-ALPSR", image);
    OrbitRecords records;
    read_palsar_leader_orbit(lea, records);
    double first = 0.0, step = 0.0;
    std::string stepText;
    read_palsar_leader_timing(lea, first, stepText, step);
    PalsarTypes types(lea, img);
    types.find_type();
    types.getPol();
    ATPalExtractor extractor;
    extractor.LeaFileName = lea;
    extractor.RawDataName = img;
    extractor.OutputFile = scratchPath("palsar_raw");
    extractor.extract();
  });
}

int radarsatCeos(const std::uint8_t* data, std::size_t size) {
  return guarded([&] {
    std::string leader, image;
    if (!splitPair(data, size, leader, image)) return;
    radarextract extractor;
    extractor.LeaderFile = putText("rs_leader", leader);
    extractor.DataFile = putText("rs_data", image);
    extractor.OutputRawFile = scratchPath("rs_raw");
    int source = 0;
    extractor.orbit_source(&source);
    extractor.run();
  });
}

int radarsatOrbit(const std::uint8_t* data, std::size_t size) {
  return guarded([&] {
    const std::string path = put("rs_orbit", data, size);
    OrbitRecords records;
    if (read_radarsat_orbit(path, records) != 0 || records.size() == 0) return;
    double pos[15] = {}, vel[15] = {};
    interp_orb_l_v2(path, records.times[records.size() / 2], 5, 8.0, pos, vel);
  });
}

const std::map<std::string, FuzzEntry>& entries() {
  static const std::map<std::string, FuzzEntry> table{
      {"job_file", jobFile},           {"profile", profileFile},
      {"parameter_store", parameterStore}, {"xml_document", xmlDocument},
      {"description_text", descriptionText}, {"description_xml", descriptionXml},
      {"ers_leader", ersLeader},       {"ers_image", ersImage},
      {"asar_level0", asarLevel0},     {"asar_aux", asarAux},
      {"deos_orbit", deosOrbit},       {"doris_orbit", dorisOrbit},
      {"palsar_ceos", palsarCeos},     {"radarsat_ceos", radarsatCeos},
      {"radarsat_orbit", radarsatOrbit},
  };
  return table;
}

}  // namespace

FuzzEntry fuzzEntry(const std::string& name) {
  const auto it = entries().find(name);
  return it == entries().end() ? nullptr : it->second;
}

std::vector<std::string> fuzzEntryNames() {
  std::vector<std::string> names;
  for (const auto& [name, entry] : entries()) names.push_back(name);
  return names;
}
