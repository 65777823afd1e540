#pragma once
// Cell types of raster files: the number held by the CellType element, the
// size of one pixel, whether it is complex, and the text of the profile-form
// header.
#include <cstdint>
#include <string_view>

enum RasterCellType : int {
  FLOAT_COMPLEX = 0,   // two 32-bit floats, re then im
  FLOAT32 = 1,
  DOUBLE_COMPLEX = 2,  // two 64-bit floats
  FLOAT64 = 3,
  INT32_COMPLEX = 4,   // two 32-bit integers (no profile text)
  INT32 = 5,
  SHORT_COMPLEX = 6,   // two 16-bit integers
  INT16 = 7,
  INT8_COMPLEX = 8,    // two 8-bit integers
  INT8 = 9,
  CELL_UNDEFINED = 10  // object not yet described: no pixel size
};

// True for the numbers 0..9.
constexpr bool cell_type_valid(int type) { return type >= 0 && type <= 9; }

// Bytes of one pixel; 0 for a number outside 0..9.
constexpr int cell_type_size(int type) {
  constexpr int sizes[10] = {8, 4, 16, 8, 8, 4, 4, 2, 2, 1};
  return cell_type_valid(type) ? sizes[type] : 0;
}

// Complex types are the even numbers 0..8.
constexpr bool cell_type_complex(int type) { return cell_type_valid(type) && type % 2 == 0; }

// Bytes of one real component (the unit of byte swapping); 0 when invalid.
constexpr int cell_type_component_size(int type) {
  return cell_type_complex(type) ? cell_type_size(type) / 2 : cell_type_size(type);
}

// Text of the profile-form header ("" for type 4 and invalid numbers).
constexpr std::string_view cell_type_text(int type) {
  switch (type) {
    case FLOAT_COMPLEX: return "FLOAT_COMPLEX";
    case FLOAT32: return "FLOAT32";
    case DOUBLE_COMPLEX: return "DOUBLE_COMPLEX";
    case FLOAT64: return "FLOAT64";
    case INT32: return "INT32";
    case SHORT_COMPLEX: return "SHORT_COMPLEX";
    case INT16: return "INT16";
    case INT8_COMPLEX: return "INT8_COMPLEX";
    case INT8: return "INT8";
    default: return "";
  }
}

// Number of a profile-form text; -1 for a text not in the table.
constexpr int cell_type_from_text(std::string_view text) {
  for (int t = 0; t <= 9; ++t)
    if (t != INT32_COMPLEX && cell_type_text(t) == text) return t;
  return -1;
}
