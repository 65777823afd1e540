#pragma once
// The real orbit members of the product records: the record library reaches
// the orbit classes only through GeneralSAROrbitSlots; this is the one made
// of GeneralSAROrbit and SAROrbitStateVectors_Obj. The records' default
// constructors and typed orbit views are defined beside it.
#include "product/general_sar.h"

const GeneralSAROrbitSlots& standardOrbitSlots();
