#pragma once
// BufferIO: a window of rows and columns on a DataFile, read into or written
// from a caller's buffer of any memory cell type, with byte swapping and the
// cell type conversions below. Also the conversion and swapping kernels
// shared with BufferFile.
#include <cstddef>
#include <cstdint>

#include "product/cell_type.h"

class DataFile;

// A plain record filled and owned by the caller.
struct BufferIO {
  DataFile* file = nullptr;
  int first_column = 0;
  int columns = 0;
  int first_row = 0;
  int rows = 0;
  int memory_type = FLOAT_COMPLEX;  // cell type number of the caller's buffer

  // Reads the window into dst, rows `stride` memory elements apart (the
  // one-argument form uses `columns`). Memory and file types must lie in
  // 0..7 (else 1). Opens the file for reading when it is closed.
  int readbuffer(void* dst);
  int readbuffer(void* dst, int stride);
  // Writes the window from src; opens the file with mode 1 ("wb",
  // truncating) when it is closed.
  int writebuffer(const void* src);
  int writebuffer(const void* src, int stride);
  // Row prefixes of the window's rows, RowPrefix bytes each, consecutive in
  // the caller's buffer; never swapped.
  int readprefix(void* dst);
  int writeprefix(const void* src);
};

// Pairs served when a file of fileType is read into memory of memType (the
// same type included). Writing serves the mirrored pairs.
bool cell_read_pair(int fileType, int memType);
inline bool cell_write_pair(int memType, int fileType) { return cell_read_pair(fileType, memType); }

// Converts n pixels of srcType at src into dstType at dst, for any two types
// 0..9: components by value, floating to integer rounded half away from zero
// with no clipping (integers wrap), complex to real keeps the real part, real
// to complex sets the imaginary part to 0. Both buffers aligned for their
// component types.
void cell_convert(const void* src, int srcType, void* dst, int dstType, size_t n);

// Reverses the bytes of each component of n pixels of `type` in place.
void cell_swap(void* data, int type, size_t n);

// x > 0 ? floor(x + 0.5) : ceil(x - 0.5)
double round_half_away(double x);
