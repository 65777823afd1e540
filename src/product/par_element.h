#pragma once
// One row of a parameter element table: a named, typed view of a variable
// (or array) of the owning object, carried to and from XML parameter
// documents by GeneralSAR_BaseXML.
#include <string>

class parElement {
 public:
  enum ParameterType : int {
    PT_DOUBLE = 0,
    PT_FLOAT = 1,
    PT_INT = 2,
    PT_STRING = 3,  // pointer is a std::string (or the first of `size` std::string)
    PT_UNSET = 4,
  };

  parElement() = default;

  // Aims the row at a variable. The scalar flag is taken from size == 1 only
  // while the row has not been registered; afterwards it stays as it was.
  void setElement(const std::string& name, void* pointer, ParameterType type, int size, double min,
                  double max, bool mandatory);

  const std::string& getName() const { return name; }
  ParameterType getType() const { return type; }
  int getSize() const { return size; }
  void* getPointer() const { return pointer; }
  double getMin() const { return min; }
  double getMax() const { return max; }
  bool isMandatory() const { return mandatory; }
  bool isScalar() const { return scalar; }
  bool isRegistered() const { return registered; }
  void setRegistered(bool value) { registered = value; }

  std::string name;
  ParameterType type = PT_UNSET;
  int size = 0;  // 0: not persisted at present
  void* pointer = nullptr;
  double min = 0.0;
  double max = 0.0;
  bool mandatory = false;
  bool scalar = false;
  bool registered = false;
};
