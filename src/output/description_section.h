#pragma once
// Description headers of the products: a tree of named sections holding
// typed fields, spelled either as XML (".sml") or as text ("_hdr").
#include <string>
#include <vector>

// Shapes and types of a field, with the numbers shown by "Data Type ID : ".
enum DescriptionFieldShape : int {
  FS_NOT_SET = 0,
  FS_SCALAR = 1,
  FS_VECTOR = 2,
  FS_MATRIX = 3,
  FS_MULTIPLE = 4,
};
enum DescriptionFieldType : int {
  FT_NOT_SET = 0,
  FT_INTEGER = 1,
  FT_DOUBLE = 2,
  FT_STRING = 3,
  FT_FIELD_OF_SECTION = 4,
};

// "SCALAR", "VECTOR", "MARTIX", "MULTIPLE"; "Not initialised" for an unset
// shape and "WRONG" for a number outside the table.
const char* descriptionShapeText(int shape);
// "Integer", "Double", "String", "Field Of Section pointer"; same rules.
const char* descriptionTypeText(int type);

// Names of the sections of a product header, in the order they are written.
const std::vector<std::string>& descriptionSectionNames();

class tesv_description_section;

class tesv_description_field {
 public:
  // Out of line: the members hold vectors of sections, complete only below.
  tesv_description_field();
  explicit tesv_description_field(std::string fieldName);

  // Setters replace shape, type and values.
  void setInt(long long value);
  void setDouble(double value);
  void setString(const std::string& value);
  void setIntVector(const std::vector<long long>& values);
  void setDoubleVector(const std::vector<double>& values);
  void setStringVector(const std::vector<std::string>& values);
  // values row by row; values.size() must be rows x cols.
  void setDoubleMatrix(int nRows, int nCols, const std::vector<double>& values);
  void setIntMatrix(int nRows, int nCols, const std::vector<long long>& values);
  // One section (scalar) or several (vector) held by the field.
  void setSections(const std::vector<tesv_description_section>& values, bool asVector);
  // A field made of sub-fields.
  void setMultiple(const std::vector<tesv_description_field>& values);
  // No value at all ("IS_EMPTY" in the files).
  void setEmpty(int fieldType);
  void setMandatory(bool flag) { mandatory = flag; }

  // Values with conversion between the numeric types; strings are parsed.
  // 0, or 1 when the element is absent or cannot be converted.
  int getDouble(double& value, int index = 0) const;
  int getInt(long long& value, int index = 0) const;
  int getInt(int& value, int index = 0) const;
  int getString(std::string& value, int index = 0) const;
  // Every value as doubles (numeric or parsable strings); 1 on a bad one.
  int getDoubles(std::vector<double>& values) const;

  int numberOfElements() const;
  int numberOfSubFields() const { return static_cast<int>(subFields.size()); }
  bool isEmpty() const { return numberOfElements() == 0; }

  // "[%s]  [%s]  [%s]" with name, shape and type, then the counts.
  std::string dump() const;

  std::string name;
  int shape = FS_NOT_SET;
  int type = FT_NOT_SET;
  bool mandatory = false;
  int rows = 0;
  int cols = 0;
  std::vector<long long> ints;
  std::vector<double> doubles;
  std::vector<std::string> strings;
  std::vector<tesv_description_section> sections;  // type FT_FIELD_OF_SECTION
  std::vector<tesv_description_field> subFields;   // shape FS_MULTIPLE

 private:
  void reset(int newShape, int newType);
};

class tesv_description_section {
 public:
  tesv_description_section() = default;
  explicit tesv_description_section(std::string sectionName) : name(std::move(sectionName)) {}

  // A sub-section by name; openSection makes it (at the end) when absent.
  tesv_description_section& openSection(const std::string& sectionName);
  tesv_description_section* findSection(const std::string& sectionName);
  const tesv_description_section* findSection(const std::string& sectionName) const;
  bool removeSection(const std::string& sectionName);

  // A field of this section, or "Section.Field" of a sub-section. nullptr
  // when absent. Pointers stay valid until the next field is added.
  tesv_description_field* getField(const std::string& fieldName);
  const tesv_description_field* getField(const std::string& fieldName) const;
  // The field, made (empty, at the end) when absent; "Section.Field" makes
  // the section too.
  tesv_description_field& setField(const std::string& fieldName);
  // Sets the mandatory flag of an existing field; 1 when absent.
  int setMandatory(const std::string& fieldName, bool flag);

  // The section and its fields, one line each, sub-sections indented.
  std::string dump() const;

  std::string name;
  std::vector<tesv_description_field> fields;
  std::vector<tesv_description_section> sections;
};

// A product header: root "HEADER_INFO" with the fixed sections, empty, in
// their order.
tesv_description_section makeProductHeader();

// Text of a double as the header files hold it: the shortest form that reads
// back to the same value, "NaN" for not-a-number, "INF" and "-INF".
std::string descriptionDoubleText(double value);
// Parses a whole text as a number ("NaN", "nan", "INF", "inf" accepted). false when
// the text is not entirely a number.
bool parseDescriptionDouble(const std::string& text, double& value);
bool parseDescriptionInt(const std::string& text, long long& value);
