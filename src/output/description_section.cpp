// Sections and fields of the description headers.
#include "output/description_section.h"
#include "base/status.h"

#include <cerrno>
#include <charconv>
#include <cmath>
#include <cstdio>
#include <cstdlib>

const char* descriptionShapeText(int shape) {
  switch (shape) {
    case FS_NOT_SET: return "Not initialised";
    case FS_SCALAR: return "SCALAR";
    case FS_VECTOR: return "VECTOR";
    case FS_MATRIX: return "MARTIX";
    case FS_MULTIPLE: return "MULTIPLE";
    default: return "WRONG";
  }
}

const char* descriptionTypeText(int type) {
  switch (type) {
    case FT_NOT_SET: return "Not initialised";
    case FT_INTEGER: return "Integer";
    case FT_DOUBLE: return "Double";
    case FT_STRING: return "String";
    case FT_FIELD_OF_SECTION: return "Field Of Section pointer";
    default: return "WRONG";
  }
}

const std::vector<std::string>& descriptionSectionNames() {
  static const std::vector<std::string> names = {
      "GCPRasterInfo",       "Baseline",
      "OrbitCorrection",     "StateVectorCalc",
      "StateVectorData",     "InitialGeometry",
      "Processing",          "RasterInfo",
      "PolarimetricCalibrationParameters",
      "interferometric_processing",
      "sar_processing",      "orbit_information",
      "Sensor",              "ChannelInfo",
      "DEMCoordinates",      "RegistrationCoordinates",
      "CartographicSystem",  "user_defined_section",
      "EnvisatFixHeader",    "EnvisatDescriptionRecord"};
  return names;
}

tesv_description_section makeProductHeader() {
  tesv_description_section root("HEADER_INFO");
  for (const auto& name : descriptionSectionNames()) root.sections.emplace_back(name);
  return root;
}

std::string descriptionDoubleText(double value) {
  if (std::isnan(value)) return "NaN";
  if (std::isinf(value)) return value > 0 ? "INF" : "-INF";
  char buffer[64];
  auto result = std::to_chars(buffer, buffer + sizeof buffer, value);
  return std::string(buffer, result.ptr);
}

bool parseDescriptionDouble(const std::string& text, double& value) {
  if (text.empty()) return false;
  if (text == "NaN" || text == "nan") {
    value = std::nan("");
    return true;
  }
  const char* begin = text.c_str();
  char* end = nullptr;
  double v = std::strtod(begin, &end);
  if (end == begin || *end != '\0') return false;
  value = v;
  return true;
}

bool parseDescriptionInt(const std::string& text, long long& value) {
  long long v = 0;
  const char* begin = text.data();
  const char* end = begin + text.size();
  if (begin != end && *begin == '+') ++begin;
  auto result = std::from_chars(begin, end, v);
  if (result.ec != std::errc() || result.ptr != end || begin == end) return false;
  value = v;
  return true;
}

// ---------------------------------------------------------------- fields

void tesv_description_field::reset(int newShape, int newType) {
  shape = newShape;
  type = newType;
  rows = cols = 0;
  ints.clear();
  doubles.clear();
  strings.clear();
  sections.clear();
  subFields.clear();
}

tesv_description_field::tesv_description_field() = default;
tesv_description_field::tesv_description_field(std::string fieldName) : name(std::move(fieldName)) {}

void tesv_description_field::setInt(long long value) {
  reset(FS_SCALAR, FT_INTEGER);
  ints.push_back(value);
}

void tesv_description_field::setDouble(double value) {
  reset(FS_SCALAR, FT_DOUBLE);
  doubles.push_back(value);
}

void tesv_description_field::setString(const std::string& value) {
  reset(FS_SCALAR, FT_STRING);
  strings.push_back(value);
}

void tesv_description_field::setIntVector(const std::vector<long long>& values) {
  reset(FS_VECTOR, FT_INTEGER);
  ints = values;
}

void tesv_description_field::setDoubleVector(const std::vector<double>& values) {
  reset(FS_VECTOR, FT_DOUBLE);
  doubles = values;
}

void tesv_description_field::setStringVector(const std::vector<std::string>& values) {
  reset(FS_VECTOR, FT_STRING);
  strings = values;
}

void tesv_description_field::setDoubleMatrix(int nRows, int nCols, const std::vector<double>& values) {
  reset(FS_MATRIX, FT_DOUBLE);
  rows = nRows;
  cols = nCols;
  doubles = values;
  doubles.resize(static_cast<std::size_t>(nRows) * static_cast<std::size_t>(nCols), 0.0);
}

void tesv_description_field::setIntMatrix(int nRows, int nCols, const std::vector<long long>& values) {
  reset(FS_MATRIX, FT_INTEGER);
  rows = nRows;
  cols = nCols;
  ints = values;
  ints.resize(static_cast<std::size_t>(nRows) * static_cast<std::size_t>(nCols), 0);
}

void tesv_description_field::setSections(const std::vector<tesv_description_section>& values,
                                         bool asVector) {
  reset(asVector ? FS_VECTOR : FS_SCALAR, FT_FIELD_OF_SECTION);
  sections = values;
}

void tesv_description_field::setMultiple(const std::vector<tesv_description_field>& values) {
  reset(FS_MULTIPLE, FT_NOT_SET);
  subFields = values;
}

void tesv_description_field::setEmpty(int fieldType) { reset(FS_SCALAR, fieldType); }

int tesv_description_field::numberOfElements() const {
  switch (type) {
    case FT_INTEGER: return static_cast<int>(ints.size());
    case FT_DOUBLE: return static_cast<int>(doubles.size());
    case FT_STRING: return static_cast<int>(strings.size());
    case FT_FIELD_OF_SECTION: return static_cast<int>(sections.size());
    default: return shape == FS_MULTIPLE ? static_cast<int>(subFields.size()) : 0;
  }
}

int tesv_description_field::getDouble(double& value, int index) const {
  if (index < 0) return STATUS_BAD_CONDITION;
  std::size_t i = static_cast<std::size_t>(index);
  switch (type) {
    case FT_DOUBLE:
      if (i >= doubles.size()) return STATUS_BAD_CONDITION;
      value = doubles[i];
      return 0;
    case FT_INTEGER:
      if (i >= ints.size()) return STATUS_BAD_CONDITION;
      value = static_cast<double>(ints[i]);
      return 0;
    case FT_STRING:
      if (i >= strings.size()) return STATUS_BAD_CONDITION;
      return parseDescriptionDouble(strings[i], value) ? 0 : 1;
    default: return STATUS_BAD_CONDITION;
  }
}

int tesv_description_field::getInt(long long& value, int index) const {
  if (index < 0) return STATUS_BAD_CONDITION;
  std::size_t i = static_cast<std::size_t>(index);
  switch (type) {
    case FT_INTEGER:
      if (i >= ints.size()) return STATUS_BAD_CONDITION;
      value = ints[i];
      return 0;
    case FT_DOUBLE: {
      if (i >= doubles.size()) return STATUS_BAD_CONDITION;
      double d = doubles[i];
      if (!std::isfinite(d) || d != std::floor(d) || std::fabs(d) > 9.0e18) return STATUS_BAD_CONDITION;
      value = static_cast<long long>(d);
      return 0;
    }
    case FT_STRING: {
      if (i >= strings.size()) return STATUS_BAD_CONDITION;
      if (parseDescriptionInt(strings[i], value)) return 0;
      double d = 0.0;
      if (!parseDescriptionDouble(strings[i], d) || !std::isfinite(d) || d != std::floor(d) ||
          std::fabs(d) > 9.0e18)
        return STATUS_BAD_CONDITION;
      value = static_cast<long long>(d);
      return 0;
    }
    default: return STATUS_BAD_CONDITION;
  }
}

int tesv_description_field::getInt(int& value, int index) const {
  long long v = 0;
  if (getInt(v, index) != 0 || v < -2147483648LL || v > 2147483647LL) return STATUS_BAD_CONDITION;
  value = static_cast<int>(v);
  return 0;
}

int tesv_description_field::getString(std::string& value, int index) const {
  if (index < 0) return STATUS_BAD_CONDITION;
  std::size_t i = static_cast<std::size_t>(index);
  switch (type) {
    case FT_STRING:
      if (i >= strings.size()) return STATUS_BAD_CONDITION;
      value = strings[i];
      return 0;
    case FT_INTEGER:
      if (i >= ints.size()) return STATUS_BAD_CONDITION;
      value = std::to_string(ints[i]);
      return 0;
    case FT_DOUBLE:
      if (i >= doubles.size()) return STATUS_BAD_CONDITION;
      value = descriptionDoubleText(doubles[i]);
      return 0;
    default: return STATUS_BAD_CONDITION;
  }
}

int tesv_description_field::getDoubles(std::vector<double>& values) const {
  int n = numberOfElements();
  std::vector<double> out(static_cast<std::size_t>(n));
  for (int i = 0; i < n; ++i)
    if (getDouble(out[static_cast<std::size_t>(i)], i) != 0) return STATUS_BAD_CONDITION;
  values = std::move(out);
  return 0;
}

std::string tesv_description_field::dump() const {
  char line[1024];
  std::snprintf(line, sizeof line, "[%s]  [%s]  [%s]", name.c_str(), descriptionShapeText(shape),
                descriptionTypeText(type));
  std::string text = line;
  if (shape == FS_MULTIPLE) {
    std::snprintf(line, sizeof line, "  [Number of sub fiels : %d]", numberOfSubFields());
  } else if (shape == FS_MATRIX) {
    std::snprintf(line, sizeof line, "  [Row Nbr : %d]  [Col Nbr : %d]", rows, cols);
  } else {
    std::snprintf(line, sizeof line, "  [Number of elements : %d]", numberOfElements());
  }
  return text + line;
}

// ---------------------------------------------------------------- sections

tesv_description_section& tesv_description_section::openSection(const std::string& sectionName) {
  if (auto* found = findSection(sectionName)) return *found;
  sections.emplace_back(sectionName);
  return sections.back();
}

tesv_description_section* tesv_description_section::findSection(const std::string& sectionName) {
  for (auto& s : sections)
    if (s.name == sectionName) return &s;
  return nullptr;
}

const tesv_description_section* tesv_description_section::findSection(
    const std::string& sectionName) const {
  for (const auto& s : sections)
    if (s.name == sectionName) return &s;
  return nullptr;
}

bool tesv_description_section::removeSection(const std::string& sectionName) {
  for (auto it = sections.begin(); it != sections.end(); ++it) {
    if (it->name == sectionName) {
      sections.erase(it);
      return true;
    }
  }
  return false;
}

tesv_description_field* tesv_description_section::getField(const std::string& fieldName) {
  return const_cast<tesv_description_field*>(
      static_cast<const tesv_description_section*>(this)->getField(fieldName));
}

const tesv_description_field* tesv_description_section::getField(const std::string& fieldName) const {
  for (const auto& f : fields)
    if (f.name == fieldName) return &f;
  auto dot = fieldName.find('.');
  if (dot == std::string::npos) return nullptr;
  const auto* section = findSection(fieldName.substr(0, dot));
  return section ? section->getField(fieldName.substr(dot + 1)) : nullptr;
}

tesv_description_field& tesv_description_section::setField(const std::string& fieldName) {
  for (auto& f : fields)
    if (f.name == fieldName) return f;
  auto dot = fieldName.find('.');
  if (dot != std::string::npos)
    return openSection(fieldName.substr(0, dot)).setField(fieldName.substr(dot + 1));
  fields.emplace_back(fieldName);
  return fields.back();
}

int tesv_description_section::setMandatory(const std::string& fieldName, bool flag) {
  auto* field = getField(fieldName);
  if (!field) return STATUS_BAD_CONDITION;
  field->mandatory = flag;
  return 0;
}

std::string tesv_description_section::dump() const {
  std::string text = "SECTION [" + name + "]\n";
  for (const auto& f : fields) text += "  " + f.dump() + "\n";
  for (const auto& s : sections) {
    std::string sub = s.dump();
    std::size_t start = 0;
    while (start < sub.size()) {
      std::size_t end = sub.find('\n', start);
      if (end == std::string::npos) end = sub.size();
      text += "  " + sub.substr(start, end - start) + "\n";
      start = end + 1;
    }
  }
  return text;
}
