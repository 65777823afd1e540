#include "product/par_element.h"

void parElement::setElement(const std::string& elementName, void* elementPointer,
                            ParameterType elementType, int elementSize, double elementMin,
                            double elementMax, bool elementMandatory) {
  name = elementName;
  pointer = elementPointer;
  type = elementType;
  size = elementSize;
  min = elementMin;
  max = elementMax;
  mandatory = elementMandatory;
  // The scalar flag is frozen after the first registration: an element
  // registered with another size stays an array though its size becomes 1.
  if (!registered) scalar = (elementSize == 1);
}
