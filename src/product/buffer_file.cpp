#include "product/buffer_file.h"

#include <sys/stat.h>

#include <algorithm>
#include <cstring>
#include <new>

#include "base/status.h"
#include "product/buffer_io.h"

BufferFile::BufferFile() { createElementsVector(6); }

BufferFile::BufferFile(const std::string& name) : filename_(name) { createElementsVector(6); }

BufferFile::~BufferFile() { close(); }

void BufferFile::refreshParameters() {
  addElementInt("NrOfLinesPerImage", &NrOfLinesPerImage_, 1, 0, 2147483647, true);
  addElementInt("NrOfPixelsPerLine", &NrOfPixelsPerLine_, 1, 0, 2147483647, true);
  addElementInt("HeaderOffset", &hdrOffset_, 1, 0, 2147483647, true);
  addElementInt("RowPrefix", &RowPrefix_, 1, 0, 2147483647, true);
  addElementInt("ByteOrder", &ByteOrder_, 1, 0, 1, true);
  addElementInt("CellType", &cellType_, 1, 0, 9, true);
  setAllocationFlag(true);
}

// ---- side file -------------------------------------------------------------------

int BufferFile::readhdr() { return readhdr(filename_ + ".hdr"); }

int BufferFile::readhdr(const std::string& file) {
  hdrOffset_ = int(HeaderOffset_);
  if (!readAuxiliaryFile(file, 1, "RasterInfo")) return STATUS_BAD_CONDITION;
  HeaderOffset_ = hdrOffset_;
  return 0;
}

int BufferFile::writehdr() { return writehdr(filename_ + ".hdr"); }

int BufferFile::writehdr(const std::string& file) {
  if (HeaderOffset_ < 0 || HeaderOffset_ > 2147483647) return STATUS_BAD_CONDITION;
  hdrOffset_ = int(HeaderOffset_);
  return writeAuxiliaryFile(file, 1, "RasterInfo");
}

// ---- stream and window ----------------------------------------------------------

bool BufferFile::open(OperationType op) {
  close();
  const char* mode = nullptr;
  switch (op) {
    case READ: mode = "rb"; break;
    case WRITE: mode = "w+b"; break;
    case UPDATE: mode = "r+b"; break;
    default: break;
  }
  opType_ = mode ? op : NOT_OPEN;
  if (mode && !stream_.open(filename_, mode)) opType_ = NOT_OPEN;
  position_ = cursor_ = valid_ = 0;
  return stream_.is_open();
}

void BufferFile::close() {
  if (stream_.is_open() && is_buffered() && (opType_ == WRITE || opType_ == UPDATE)) flushWindow();
  stream_.close();
  window_.reset();
  windowSize_ = back_ = cursor_ = valid_ = 0;
  position_ = 0;
  opType_ = NOT_OPEN;
}

bool BufferFile::exists() const {
  struct stat st {};
  return ::stat(filename_.c_str(), &st) == 0;
}

int64_t BufferFile::fileSize() const {
  int64_t size = stream_.size();
  if (is_buffered() && opType_ != READ) size = std::max(size, position_ + valid_);
  return size;
}

void BufferFile::initbuffer(int64_t size, int64_t back) {
  if (size <= 0) return;
  const int64_t start = tell();
  if (is_buffered() && opType_ != READ) flushWindow();
  window_.reset(new (std::nothrow) char[size_t(size)]());
  if (!window_) {
    windowSize_ = 0;
    return;
  }
  windowSize_ = size;
  back_ = (opType_ == READ) ? std::clamp<int64_t>(back, 0, size) : 0;
  cursor_ = valid_ = 0;
  if (!stream_.is_open()) {
    position_ = start;
    return;
  }
  if (opType_ == READ) {
    const int64_t got = stream_.pread(window_.get(), size, start);
    valid_ = std::max<int64_t>(got, 0);
    position_ = start + valid_;
  } else {
    position_ = start;
    if (opType_ == UPDATE) {
      const int64_t got = std::max<int64_t>(stream_.pread(window_.get(), size, start), 0);
      std::memset(window_.get() + got, 0, size_t(size - got));
    }
  }
}

void BufferFile::flushWindow() {
  if (valid_ > 0) stream_.pwrite(window_.get(), valid_, position_);
}

// Write and update mode: flush the page and load the one around `target`,
// starting half a window before it (or at 0).
void BufferFile::loadWriteWindow(int64_t target) {
  flushWindow();
  const int64_t half = windowSize_ / 2;
  const int64_t start = target >= half ? target - half : 0;
  const int64_t got = std::max<int64_t>(stream_.pread(window_.get(), windowSize_, start), 0);
  std::memset(window_.get() + got, 0, size_t(windowSize_ - got));
  position_ = start;
  cursor_ = target - start;
  valid_ = cursor_;
}

int64_t BufferFile::tell() const {
  if (opType_ == READ) return position_ - valid_ + cursor_;
  return position_ + cursor_;
}

void BufferFile::seek(int64_t offset, SeekType whence) {
  if (!stream_.is_open()) return;
  int64_t target;
  switch (whence) {
    case FROM_START: target = offset; break;
    case FROM_CURRENT: target = tell() + offset; break;
    case FROM_END: target = fileSize() + offset; break;
    default: return;
  }
  if (target < 0) return;
  if (!is_buffered()) {
    position_ = target;
    return;
  }
  if (opType_ == READ) {
    const int64_t first = position_ - valid_;
    // The end of the loaded data counts as inside: the next read refills.
    if (target >= first && target <= position_) {
      cursor_ = target - first;
      return;
    }
    const int64_t start = std::max<int64_t>(target - back_, 0);
    const int64_t got = stream_.pread(window_.get(), windowSize_, start);
    valid_ = std::max<int64_t>(got, 0);
    position_ = start + valid_;
    cursor_ = target - start;
    return;
  }
  if (target >= position_ && target < position_ + windowSize_) {
    cursor_ = target - position_;
    valid_ = std::max(valid_, cursor_);
    return;
  }
  loadWriteWindow(target);
}

int64_t BufferFile::read(void* dst, int64_t n) {
  if (!stream_.is_open() || n <= 0) return 0;
  char* out = static_cast<char*>(dst);
  if (!is_buffered()) {
    const int64_t got = std::max<int64_t>(stream_.pread(out, n, position_), 0);
    position_ += got;
    return got;
  }
  int64_t delivered = 0;
  if (opType_ != READ) {
    // Reading through the read-modify-write page.
    while (n > 0) {
      if (cursor_ >= windowSize_) loadWriteWindow(position_ + cursor_);
      const int64_t take = std::min(windowSize_ - cursor_, n);
      std::memcpy(out + delivered, window_.get() + cursor_, size_t(take));
      cursor_ += take;
      delivered += take;
      n -= take;
    }
    return delivered;
  }
  while (n > 0) {
    if (cursor_ < valid_) {
      const int64_t take = std::min(valid_ - cursor_, n);
      std::memcpy(out + delivered, window_.get() + cursor_, size_t(take));
      cursor_ += take;
      delivered += take;
      n -= take;
      continue;
    }
    if (cursor_ > valid_) {
      // A seek landed beyond the data that the last load found.
      position_ = position_ - valid_ + cursor_;
      valid_ = cursor_ = 0;
    }
    if (n >= windowSize_ / 2) {
      // Large request: straight from the stream into the caller's buffer;
      // the window keeps the back-reach from its end.
      const int64_t got = std::max<int64_t>(stream_.pread(out + delivered, n, position_), 0);
      if (got == 0) break;
      position_ += got;
      delivered += got;
      n -= got;
      const int64_t keep = std::min(back_, got);
      std::memcpy(window_.get(), out + delivered - keep, size_t(keep));
      valid_ = cursor_ = keep;
      if (n > 0) break;  // end of file
      continue;
    }
    // Keep a back-reach of the old window, fill the rest from the stream.
    const int64_t keep = std::min(back_, valid_ / 2);
    std::memmove(window_.get(), window_.get() + valid_ - keep, size_t(keep));
    const int64_t got = stream_.pread(window_.get() + keep, windowSize_ - keep, position_);
    valid_ = keep;
    cursor_ = keep;
    if (got <= 0) break;
    position_ += got;
    valid_ += got;
  }
  return delivered;
}

int64_t BufferFile::write(const void* src, int64_t n) {
  if (!stream_.is_open() || n <= 0) return 0;
  const char* in = static_cast<const char*>(src);
  if (!is_buffered()) {
    const int64_t put = std::max<int64_t>(stream_.pwrite(in, n, position_), 0);
    position_ += put;
    return put;
  }
  if (opType_ == READ) return 0;
  if (cursor_ + n <= windowSize_) {
    std::memcpy(window_.get() + cursor_, in, size_t(n));
    cursor_ += n;
    valid_ = std::max(valid_, cursor_);
    return n;
  }
  // Crossing the end: fill and flush the window, then continue with a window
  // whose first half ends where the data end.
  const int64_t first = windowSize_ - cursor_;
  std::memcpy(window_.get() + cursor_, in, size_t(first));
  valid_ = windowSize_;
  flushWindow();
  const int64_t rest = n - first;
  const int64_t half = windowSize_ / 2;
  const char* tail = in + first;
  const int64_t end = position_ + windowSize_ + rest;
  if (rest <= half) {
    const int64_t keep = half - rest;
    std::memmove(window_.get(), window_.get() + windowSize_ - keep, size_t(keep));
    std::memcpy(window_.get() + keep, tail, size_t(rest));
  } else {
    stream_.pwrite(tail, rest - half, position_ + windowSize_);
    std::memcpy(window_.get(), tail + rest - half, size_t(half));
  }
  position_ = end - half;
  const int64_t got =
      std::max<int64_t>(stream_.pread(window_.get() + half, windowSize_ - half, position_ + half), 0);
  std::memset(window_.get() + half + got, 0, size_t(windowSize_ - half - got));
  cursor_ = valid_ = half;
  return n;
}

// ---- typed blocks ----------------------------------------------------------------

int64_t BufferFile::transfer(void* memory, int memType, bool complexForm, int firstRow, int rows,
                             int firstColumn, int columns, bool writing) {
  if (!stream_.is_open() || rows <= 0) return 0;
  const int ft = cellType_;
  if (ft < 0 || ft > 7 || cell_type_complex(ft) != complexForm) return 0;
  if (columns == 0) columns = NrOfPixelsPerLine_ - firstColumn;
  if (columns <= 0) return 0;
  const int ps = cell_type_size(ft), ms = cell_type_size(memType);
  const int64_t bytes = int64_t(columns) * ps;
  const int64_t lead = int64_t(firstColumn) * ps + RowPrefix_;
  const int64_t trail = int64_t(NrOfPixelsPerLine_ - columns - firstColumn) * ps;
  const bool swap = ByteOrder_ != host_byte_order() && cell_type_component_size(ft) > 1;
  const bool direct = (memType == ft) && !swap;
  char* mem = static_cast<char*>(memory);
  const int64_t pitch = int64_t(columns) * ms;

  seek(rowstart(firstRow), FROM_START);
  if (direct && lead == 0 && trail == 0) {
    const int64_t total = bytes * rows;
    return writing ? write(mem, total) : read(mem, total);
  }
  std::unique_ptr<double[]> row;
  if (!direct) {
    row.reset(new (std::nothrow) double[size_t((bytes + 7) / 8)]());
    if (!row) return 0;
  }
  char* buf = direct ? nullptr : reinterpret_cast<char*>(row.get());
  int64_t moved = 0;
  for (int r = 0; r < rows; ++r) {
    char* m = mem + r * pitch;
    if (lead) seek(lead, FROM_CURRENT);
    if (writing) {
      const char* out = m;
      if (!direct) {
        cell_convert(m, memType, buf, ft, size_t(columns));
        if (swap) cell_swap(buf, ft, size_t(columns));
        out = buf;
      }
      const int64_t put = write(out, bytes);
      moved += put;
      if (put != bytes) break;
    } else {
      const int64_t got = read(direct ? m : buf, bytes);
      moved += got;
      if (got != bytes) break;
      if (!direct) {
        if (swap) cell_swap(buf, ft, size_t(columns));
        cell_convert(buf, ft, m, memType, size_t(columns));
      }
    }
    if (trail) seek(trail, FROM_CURRENT);
  }
  return moved;
}

int64_t BufferFile::readbuffer(float* buf, int fr, int rows, int fc, int cols) {
  return transfer(buf, ::FLOAT32, false, fr, rows, fc, cols, false);
}
int64_t BufferFile::readbuffer(double* buf, int fr, int rows, int fc, int cols) {
  return transfer(buf, ::FLOAT64, false, fr, rows, fc, cols, false);
}
int64_t BufferFile::readbuffer(int* buf, int fr, int rows, int fc, int cols) {
  return transfer(buf, ::INT32, false, fr, rows, fc, cols, false);
}
int64_t BufferFile::readbuffer(short* buf, int fr, int rows, int fc, int cols) {
  return transfer(buf, ::INT16, false, fr, rows, fc, cols, false);
}
int64_t BufferFile::readbuffer(fcomplex* buf, int fr, int rows, int fc, int cols) {
  return transfer(buf, ::FLOAT_COMPLEX, true, fr, rows, fc, cols, false);
}
int64_t BufferFile::readbuffer(dcomplex* buf, int fr, int rows, int fc, int cols) {
  return transfer(buf, ::DOUBLE_COMPLEX, true, fr, rows, fc, cols, false);
}
int64_t BufferFile::writebuffer(const float* buf, int fr, int rows, int fc, int cols) {
  return transfer(const_cast<float*>(buf), ::FLOAT32, false, fr, rows, fc, cols, true);
}
int64_t BufferFile::writebuffer(const double* buf, int fr, int rows, int fc, int cols) {
  return transfer(const_cast<double*>(buf), ::FLOAT64, false, fr, rows, fc, cols, true);
}
int64_t BufferFile::writebuffer(const int* buf, int fr, int rows, int fc, int cols) {
  return transfer(const_cast<int*>(buf), ::INT32, false, fr, rows, fc, cols, true);
}
int64_t BufferFile::writebuffer(const short* buf, int fr, int rows, int fc, int cols) {
  return transfer(const_cast<short*>(buf), ::INT16, false, fr, rows, fc, cols, true);
}
int64_t BufferFile::writebuffer(const fcomplex* buf, int fr, int rows, int fc, int cols) {
  return transfer(const_cast<fcomplex*>(buf), ::FLOAT_COMPLEX, true, fr, rows, fc, cols, true);
}
int64_t BufferFile::writebuffer(const dcomplex* buf, int fr, int rows, int fc, int cols) {
  return transfer(const_cast<dcomplex*>(buf), ::DOUBLE_COMPLEX, true, fr, rows, fc, cols, true);
}

int64_t BufferFile::prefixes(char* buf, int firstRow, int rows, bool writing) {
  if (!stream_.is_open() || !cell_type_valid(cellType_) || RowPrefix_ <= 0) return 0;
  const int64_t pixels = int64_t(NrOfPixelsPerLine_) * pixelsizeof();
  seek(rowstart(firstRow), FROM_START);
  int64_t moved = 0;
  for (int r = 0; r < rows; ++r) {
    char* p = buf + int64_t(r) * RowPrefix_;
    const int64_t n = writing ? write(p, RowPrefix_) : read(p, RowPrefix_);
    moved += n;
    if (n != RowPrefix_) break;
    if (pixels) seek(pixels, FROM_CURRENT);
  }
  return moved;
}

int64_t BufferFile::readprefix(char* buf, int firstRow, int rows) {
  return prefixes(buf, firstRow, rows, false);
}

int64_t BufferFile::writeprefix(const char* buf, int firstRow, int rows) {
  return prefixes(const_cast<char*>(buf), firstRow, rows, true);
}

void BufferFile::writeOffset(const char* block, int length) {
  const int64_t at = tell();
  write(block, length);
  seek(at, FROM_START);
  HeaderOffset_ = length;
}

// ---- point reads -------------------------------------------------------------------

template <typename T>
T BufferFile::readPoint(int row, int column, int type) {
  T value{};
  if (!stream_.is_open() || ByteOrder_ != 0 || cellType_ != type) return value;
  seek(rowstart(row) + RowPrefix_ + int64_t(column) * pixelsizeof(), FROM_START);
  if (read(&value, sizeof(T)) != int64_t(sizeof(T))) return T{};
  return value;
}

float BufferFile::readFloat(int row, int column) { return readPoint<float>(row, column, FLOAT32); }
double BufferFile::readDouble(int row, int column) {
  return readPoint<double>(row, column, FLOAT64);
}
int BufferFile::readInt(int row, int column) { return readPoint<int32_t>(row, column, INT32); }
short BufferFile::readShort(int row, int column) { return readPoint<int16_t>(row, column, INT16); }
fcomplex BufferFile::readFloatComplex(int row, int column) {
  return readPoint<fcomplex>(row, column, FLOAT_COMPLEX);
}
dcomplex BufferFile::readDoubleComplex(int row, int column) {
  return readPoint<dcomplex>(row, column, DOUBLE_COMPLEX);
}

// ---- copies ------------------------------------------------------------------------

void BufferFile::clone(BufferFile* other) const {
  if (!other || other == this) return;
  other->close();
  other->filename_ = filename_;
  other->NrOfLinesPerImage_ = NrOfLinesPerImage_;
  other->NrOfPixelsPerLine_ = NrOfPixelsPerLine_;
  other->RowPrefix_ = RowPrefix_;
  other->HeaderOffset_ = HeaderOffset_;
  other->cellType_ = cellType_;
  other->ByteOrder_ = ByteOrder_;
}

int64_t BufferFile::copy(const std::string& newname, int chunk) {
  if (chunk <= 0 || !cell_type_valid(cellType_)) return 0;
  RasterStream in, out;
  if (!in.open(filename_, "rb") || !out.open(newname, "wb")) return 0;
  const int64_t total = HeaderOffset_ + int64_t(NrOfLinesPerImage_) * rowlength();
  std::unique_ptr<char[]> piece(new (std::nothrow) char[size_t(chunk)]);
  if (!piece) return 0;
  const int64_t pieces = total / chunk + 1;
  int64_t copied = 0;
  for (int64_t i = 0; i < pieces; ++i) {
    const int64_t at = i * chunk;
    const int64_t n = (i == pieces - 1) ? total - at : chunk;
    if (n <= 0) break;
    const int64_t got = std::max<int64_t>(in.pread(piece.get(), n, at), 0);
    copied += std::max<int64_t>(out.pwrite(piece.get(), got, at), 0);
    if (got != n) break;
  }
  out.close();
  BufferFile target;
  clone(&target);
  target.filename_ = newname;
  target.writehdr();
  return copied;
}
