#include "product/buffer_io.h"

#include <cmath>
#include <cstring>
#include <memory>
#include <new>
#include <type_traits>

#include "base/status.h"
#include "diag/report.h"
#include "product/data_file.h"

// ---- conversion kernels ----------------------------------------------------------

double round_half_away(double x) { return x > 0 ? std::floor(x + 0.5) : std::ceil(x - 0.5); }

bool cell_read_pair(int fileType, int memType) {
  // Rows: file type; bit m set: memory type m is served.
  static constexpr unsigned short served[8] = {
      /* 0 FLOAT_COMPLEX  */ 1u << 0 | 1u << 2,
      /* 1 FLOAT32        */ 1u << 1 | 1u << 3 | 1u << 0,
      /* 2 DOUBLE_COMPLEX */ 1u << 2 | 1u << 0,
      /* 3 FLOAT64        */ 1u << 3 | 1u << 1 | 1u << 2,
      /* 4 INT32_COMPLEX  */ 1u << 4 | 1u << 0 | 1u << 6 | 1u << 2,
      /* 5 INT32          */ 1u << 5 | 1u << 1 | 1u << 7 | 1u << 3 | 1u << 0,
      /* 6 SHORT_COMPLEX  */ 1u << 6 | 1u << 0 | 1u << 4 | 1u << 2,
      /* 7 INT16          */ 1u << 7 | 1u << 1 | 1u << 5 | 1u << 3 | 1u << 0,
  };
  if (fileType < 0 || fileType > 7 || memType < 0 || memType > 7) return fileType == memType;
  return (served[fileType] >> memType) & 1u;
}

namespace {

template <typename D, typename S>
inline D convertValue(S v) {
  if constexpr (std::is_floating_point_v<D> || std::is_integral_v<S>) {
    return static_cast<D>(v);  // widening, narrowing float, integer assignment
  } else {
    // Floating to integer: half away from zero, no clipping; out-of-range
    // values wrap instead of being undefined.
    const double r = round_half_away(double(v));
    int64_t w = INT64_MIN;
    if (r > -9223372036854775808.0 && r < 9223372036854775808.0) w = static_cast<int64_t>(r);
    return static_cast<D>(w);
  }
}

template <typename S, typename D>
void convertRun(const S* s, size_t sstep, D* d, size_t dstep, size_t n) {
  if (sstep == 1 && dstep == 1) {
    for (size_t i = 0; i < n; ++i) d[i] = convertValue<D>(s[i]);
  } else {
    for (size_t i = 0; i < n; ++i) d[i * dstep] = convertValue<D>(s[i * sstep]);
  }
}

template <typename S>
void convertFrom(const S* s, size_t sstep, void* dst, int dstType, size_t dstep, size_t n) {
  switch (dstType) {
    case FLOAT_COMPLEX:
    case FLOAT32: convertRun(s, sstep, static_cast<float*>(dst), dstep, n); break;
    case DOUBLE_COMPLEX:
    case FLOAT64: convertRun(s, sstep, static_cast<double*>(dst), dstep, n); break;
    case INT32_COMPLEX:
    case INT32: convertRun(s, sstep, static_cast<int32_t*>(dst), dstep, n); break;
    case SHORT_COMPLEX:
    case INT16: convertRun(s, sstep, static_cast<int16_t*>(dst), dstep, n); break;
    case INT8_COMPLEX:
    case INT8: convertRun(s, sstep, static_cast<int8_t*>(dst), dstep, n); break;
    default: break;
  }
}

void convertComponents(const void* src, int srcType, size_t sstep, void* dst, int dstType,
                       size_t dstep, size_t n) {
  switch (srcType) {
    case FLOAT_COMPLEX:
    case FLOAT32: convertFrom(static_cast<const float*>(src), sstep, dst, dstType, dstep, n); break;
    case DOUBLE_COMPLEX:
    case FLOAT64: convertFrom(static_cast<const double*>(src), sstep, dst, dstType, dstep, n); break;
    case INT32_COMPLEX:
    case INT32: convertFrom(static_cast<const int32_t*>(src), sstep, dst, dstType, dstep, n); break;
    case SHORT_COMPLEX:
    case INT16: convertFrom(static_cast<const int16_t*>(src), sstep, dst, dstType, dstep, n); break;
    case INT8_COMPLEX:
    case INT8: convertFrom(static_cast<const int8_t*>(src), sstep, dst, dstType, dstep, n); break;
    default: break;
  }
}

}  // namespace

void cell_convert(const void* src, int srcType, void* dst, int dstType, size_t n) {
  if (!cell_type_valid(srcType) || !cell_type_valid(dstType) || n == 0) return;
  if (srcType == dstType) {
    std::memcpy(dst, src, n * size_t(cell_type_size(srcType)));
    return;
  }
  const bool sc = cell_type_complex(srcType), dc = cell_type_complex(dstType);
  if (sc == dc) {
    convertComponents(src, srcType, 1, dst, dstType, 1, sc ? 2 * n : n);
  } else if (sc) {
    convertComponents(src, srcType, 2, dst, dstType, 1, n);  // real part only
  } else {
    convertComponents(src, srcType, 1, dst, dstType, 2, n);
    // Imaginary parts to zero.
    const size_t half = size_t(cell_type_component_size(dstType));
    char* d = static_cast<char*>(dst);
    for (size_t i = 0; i < n; ++i) std::memset(d + (2 * i + 1) * half, 0, half);
  }
}

void cell_swap(void* data, int type, size_t n) {
  const int unit = cell_type_component_size(type);
  const size_t count = cell_type_complex(type) ? 2 * n : n;
  char* p = static_cast<char*>(data);
  switch (unit) {
    case 2:
      for (size_t i = 0; i < count; ++i) {
        uint16_t v;
        std::memcpy(&v, p + 2 * i, 2);
        v = __builtin_bswap16(v);
        std::memcpy(p + 2 * i, &v, 2);
      }
      break;
    case 4:
      for (size_t i = 0; i < count; ++i) {
        uint32_t v;
        std::memcpy(&v, p + 4 * i, 4);
        v = __builtin_bswap32(v);
        std::memcpy(p + 4 * i, &v, 4);
      }
      break;
    case 8:
      for (size_t i = 0; i < count; ++i) {
        uint64_t v;
        std::memcpy(&v, p + 8 * i, 8);
        v = __builtin_bswap64(v);
        std::memcpy(p + 8 * i, &v, 8);
      }
      break;
    default: break;  // single bytes: nothing to swap
  }
}

// ---- BufferIO ----------------------------------------------------------------------

namespace {

constexpr int kSeekCur = 1;

// Row buffer aligned for every component type.
std::unique_ptr<double[]> rowBuffer(int64_t bytes) {
  const size_t words = size_t((bytes + 7) / 8);
  return std::unique_ptr<double[]>(new (std::nothrow) double[words > 0 ? words : 1]());
}

// Relative seek that leaves the file alone when there is nothing to move.
int skip(DataFile& f, int64_t offset) {
  return offset == 0 ? STATUS_OK : f.seek(offset, kSeekCur);
}

}  // namespace

int BufferIO::readbuffer(void* dst) { return readbuffer(dst, columns); }

int BufferIO::readbuffer(void* dst, int stride) {
  if (!file) return STATUS_BAD_CONDITION;
  DataFile& f = *file;
  const int ft = f.CellType, mt = memory_type;
  if (mt < 0 || mt > 7 || ft < 0 || ft > 7) return STATUS_BAD_CONDITION;
  int status;
  if (!f.is_open()) {
    if ((status = f.open(0)) != STATUS_OK) {
      ORV_REPORT_CALLED_ERROR();
      return status;
    }
  }
  const int ps = cell_type_size(ft), ms = cell_type_size(mt);
  const int64_t rowlen = f.rowlength();
  if ((status = skip(f, f.rowstart(first_row) - f.tell())) != STATUS_OK) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  if (rows <= 0) return STATUS_OK;
  const int64_t lead = int64_t(first_column) * ps + f.RowPrefix;
  const int64_t trail = int64_t(f.NrOfPixelsPerLine - columns - first_column) * ps;
  const int64_t bytes = int64_t(columns) * ps;
  const bool swap = f.ByteOrder != 0;
  const bool direct = (mt == ft) && !swap;
  char* out = static_cast<char*>(dst);
  const int64_t pitch = int64_t(stride) * ms;

  if (direct && lead == 0 && trail == 0 && pitch == rowlen && !f.is_buffered()) {
    // Whole rows without prefix, same type: one transfer.
    if ((status = f.read(out, rowlen * rows)) != STATUS_OK) ORV_REPORT_CALLED_ERROR();
    return status;
  }
  std::unique_ptr<double[]> row;
  if (!direct) {
    row = rowBuffer(bytes);
    if (!row) {
      ORV_REPORT("Memory allocation failure", REPORT_ERROR);
      return STATUS_NO_MEMORY;
    }
  }
  if (direct) {
    if ((status = f.readRows(out, pitch, rows, lead, bytes, trail)) != STATUS_OK)
      ORV_REPORT_CALLED_ERROR();
    return status;
  }
  const bool converts = cell_read_pair(ft, mt);
  for (int r = 0; r < rows; ++r) {
    char* target = out + r * pitch;
    char* in = direct ? target : reinterpret_cast<char*>(row.get());
    if ((status = skip(f, lead)) != STATUS_OK || (status = f.read(in, bytes)) != STATUS_OK ||
        (status = skip(f, trail)) != STATUS_OK) {
      ORV_REPORT_CALLED_ERROR();
      return status;
    }
    if (direct || !converts) continue;  // a pair without conversion leaves dst untouched
    if (swap) cell_swap(in, ft, size_t(columns));
    cell_convert(in, ft, target, mt, size_t(columns));
  }
  return STATUS_OK;
}

int BufferIO::writebuffer(const void* src) { return writebuffer(src, columns); }

int BufferIO::writebuffer(const void* src, int stride) {
  if (!file) return STATUS_BAD_CONDITION;
  DataFile& f = *file;
  const int ft = f.CellType, mt = memory_type;
  if (!cell_type_valid(ft) || !cell_type_valid(mt)) return STATUS_BAD_CONDITION;
  int status;
  if (!f.is_open()) {
    if ((status = f.open(1)) != STATUS_OK) {
      ORV_REPORT_CALLED_ERROR();
      return status;
    }
  }
  const int ps = cell_type_size(ft), ms = cell_type_size(mt);
  const int64_t rowlen = f.rowlength();
  if ((status = skip(f, f.rowstart(first_row) - f.tell())) != STATUS_OK) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  if (rows <= 0) return STATUS_OK;
  const int64_t lead = int64_t(first_column) * ps + f.RowPrefix;
  const int64_t trail = int64_t(f.NrOfPixelsPerLine - columns - first_column) * ps;
  const int64_t bytes = int64_t(columns) * ps;
  const bool swap = f.ByteOrder != host_byte_order() && cell_type_component_size(ft) > 1;
  const bool direct = (mt == ft) && !swap;
  const char* in = static_cast<const char*>(src);
  const int64_t pitch = int64_t(stride) * ms;

  if (direct && lead == 0 && trail == 0 && pitch == rowlen && !f.is_buffered()) {
    if ((status = f.write(in, rowlen * rows)) != STATUS_OK) ORV_REPORT_CALLED_ERROR();
    return status;
  }
  std::unique_ptr<double[]> row;
  if (!direct) {
    row = rowBuffer(bytes);
    if (!row) {
      ORV_REPORT("Memory allocation failure", REPORT_ERROR);
      return STATUS_NO_MEMORY;
    }
  }
  const bool converts = cell_write_pair(mt, ft);
  for (int r = 0; r < rows; ++r) {
    const char* source = in + r * pitch;
    const char* out = source;
    if (!direct) {
      char* buf = reinterpret_cast<char*>(row.get());
      // A pair without conversion leaves the (zeroed) row as it is.
      if (converts) cell_convert(source, mt, buf, ft, size_t(columns));
      if (swap) cell_swap(buf, ft, size_t(columns));
      out = buf;
    }
    if ((status = skip(f, lead)) != STATUS_OK || (status = f.write(out, bytes)) != STATUS_OK ||
        (status = skip(f, trail)) != STATUS_OK) {
      ORV_REPORT_CALLED_ERROR();
      return status;
    }
  }
  return STATUS_OK;
}

int BufferIO::readprefix(void* dst) {
  if (!file) return STATUS_BAD_CONDITION;
  DataFile& f = *file;
  if (!cell_type_valid(f.CellType)) return STATUS_BAD_CONDITION;
  int status;
  if (!f.is_open()) {
    if ((status = f.open(0)) != STATUS_OK) {
      ORV_REPORT_CALLED_ERROR();
      return status;
    }
  }
  if ((status = skip(f, f.rowstart(first_row) - f.tell())) != STATUS_OK) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  const int64_t pixels = int64_t(f.NrOfPixelsPerLine) * f.element_sizeof();
  char* out = static_cast<char*>(dst);
  for (int r = 0; r < rows && f.RowPrefix > 0; ++r) {
    if ((status = f.read(out + int64_t(r) * f.RowPrefix, f.RowPrefix)) != STATUS_OK ||
        (status = skip(f, pixels)) != STATUS_OK) {
      ORV_REPORT_CALLED_ERROR();
      return status;
    }
  }
  return STATUS_OK;
}

int BufferIO::writeprefix(const void* src) {
  if (!file) return STATUS_BAD_CONDITION;
  DataFile& f = *file;
  if (!cell_type_valid(f.CellType)) return STATUS_BAD_CONDITION;
  int status;
  if (!f.is_open()) {
    if ((status = f.open(1)) != STATUS_OK) {
      ORV_REPORT_CALLED_ERROR();
      return status;
    }
  }
  if ((status = skip(f, f.rowstart(first_row) - f.tell())) != STATUS_OK) {
    ORV_REPORT_CALLED_ERROR();
    return status;
  }
  const int64_t pixels = int64_t(f.NrOfPixelsPerLine) * f.element_sizeof();
  const char* in = static_cast<const char*>(src);
  for (int r = 0; r < rows && f.RowPrefix > 0; ++r) {
    if ((status = f.write(in + int64_t(r) * f.RowPrefix, f.RowPrefix)) != STATUS_OK ||
        (status = skip(f, pixels)) != STATUS_OK) {
      ORV_REPORT_CALLED_ERROR();
      return status;
    }
  }
  return STATUS_OK;
}
