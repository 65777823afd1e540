#include "product/data_file.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <sys/uio.h>
#include <unistd.h>

#include <algorithm>
#include <bit>
#include <cerrno>
#include <climits>
#include <cstdio>
#include <cstring>
#include <new>
#include <vector>

#include "base/status.h"
#include "diag/ckerr.h"
#include "diag/report.h"
#include "product/raster_info.h"

// ---- RasterStream ------------------------------------------------------------

RasterStream& RasterStream::operator=(RasterStream&& other) noexcept {
  if (this != &other) {
    close();
    fd_ = other.fd_;
    other.fd_ = -1;
  }
  return *this;
}

bool RasterStream::open(const std::string& name, const char* mode) {
  close();
  const std::string m(mode ? mode : "");
  int flags = 0;
  if (m == "rb" || m == "r")
    flags = O_RDONLY;
  else if (m == "wb" || m == "w")
    flags = O_WRONLY | O_CREAT | O_TRUNC;
  else if (m == "r+b" || m == "rb+" || m == "r+")
    flags = O_RDWR;
  else if (m == "w+b" || m == "wb+" || m == "w+")
    flags = O_RDWR | O_CREAT | O_TRUNC;
  else {
    errno = EINVAL;
    return false;
  }
  do {
    fd_ = ::open(name.c_str(), flags | O_CLOEXEC, 0666);
  } while (fd_ < 0 && errno == EINTR);
  return fd_ >= 0;
}

int RasterStream::close() {
  if (fd_ < 0) return 0;
  const int rc = ::close(fd_);
  fd_ = -1;
  return rc == 0 ? 0 : -1;
}

int64_t RasterStream::pread(void* dst, int64_t n, int64_t position) const {
  if (fd_ < 0 || n < 0 || position < 0) {
    errno = EBADF;
    return -1;
  }
  char* p = static_cast<char*>(dst);
  int64_t done = 0;
  while (done < n) {
    // One call moves at most ~2 GiB on Linux; loop for the rest.
    const size_t ask = size_t(std::min<int64_t>(n - done, int64_t(1) << 30));
    const ssize_t got = ::pread(fd_, p + done, ask, off_t(position + done));
    if (got < 0) {
      if (errno == EINTR) continue;
      return done > 0 ? done : -1;
    }
    if (got == 0) break;
    done += got;
  }
  return done;
}

int64_t RasterStream::pwrite(const void* src, int64_t n, int64_t position) const {
  if (fd_ < 0 || n < 0 || position < 0) {
    errno = EBADF;
    return -1;
  }
  const char* p = static_cast<const char*>(src);
  int64_t done = 0;
  while (done < n) {
    const size_t ask = size_t(std::min<int64_t>(n - done, int64_t(1) << 30));
    const ssize_t put = ::pwrite(fd_, p + done, ask, off_t(position + done));
    if (put < 0) {
      if (errno == EINTR) continue;
      return done > 0 ? done : -1;
    }
    if (put == 0) break;
    done += put;
  }
  return done;
}

bool RasterStream::pwriteRows(const void* src, int64_t pitch, int64_t rowBytes, int64_t rows,
                              int64_t position) const {
  if (rows <= 0 || rowBytes <= 0) return true;
  if (fd_ < 0 || position < 0) return false;
  if (pitch == rowBytes) return pwrite(src, rows * rowBytes, position) == rows * rowBytes;
  const char* from = static_cast<const char*>(src);
  std::vector<iovec> iov;
  for (int64_t r0 = 0; r0 < rows; r0 += IOV_MAX) {
    const int64_t n = std::min<int64_t>(IOV_MAX, rows - r0);
    iov.resize(size_t(n));
    for (int64_t r = 0; r < n; ++r)
      iov[size_t(r)] = {const_cast<char*>(from + (r0 + r) * pitch), size_t(rowBytes)};
    int64_t at = position + r0 * rowBytes;
    size_t first = 0;
    while (first < iov.size()) {
      const ssize_t put = ::pwritev(fd_, iov.data() + first, int(iov.size() - first), off_t(at));
      if (put < 0 && errno == EINTR) continue;
      if (put <= 0) return false;
      at += put;
      // Skip what was written; a row written in part continues where it stopped.
      size_t left = size_t(put);
      while (first < iov.size() && left >= iov[first].iov_len) left -= iov[first++].iov_len;
      if (left > 0) {
        iov[first].iov_base = static_cast<char*>(iov[first].iov_base) + left;
        iov[first].iov_len -= left;
      }
    }
  }
  return true;
}

int64_t RasterStream::preadShared(void* dst, int64_t n, int64_t position) const {
  constexpr int64_t kPart = int64_t(16) << 20;
  const int64_t parts = std::max<int64_t>(1, (n + kPart - 1) / kPart);
  char* to = static_cast<char*>(dst);
  bool whole = true;
#pragma omp parallel for schedule(static) reduction(&& : whole)
  for (int64_t p = 0; p < parts; ++p) {
    const int64_t at = p * kPart, len = std::min(kPart, n - at);
    whole = pread(to + at, len, position + at) == len && whole;
  }
  return whole ? n : -1;
}

bool RasterStream::putRowsShared(const void* src, int64_t pitch, int64_t rowBytes, int64_t rows,
                                 int64_t position) const {
  if (rows <= 0 || rowBytes <= 0) return true;
  if (fd_ < 0 || position < 0) return false;
  const bool readable = (fcntl(fd_, F_GETFL) & O_ACCMODE) == O_RDWR;
  if (!readable || fallocate(fd_, 0, off_t(position), off_t(rows * rowBytes)) != 0) {
    if (readable && errno != EOPNOTSUPP && errno != ENOSYS && errno != EINVAL) return false;
    return pwriteRows(src, pitch, rowBytes, rows, position);
  }
  constexpr int64_t kWindowBytes = int64_t(32) << 20;
  const int64_t page = sysconf(_SC_PAGESIZE);
  const int64_t perWindow = std::max<int64_t>(1, kWindowBytes / rowBytes);
  const char* from = static_cast<const char*>(src);
  for (int64_t r0 = 0; r0 < rows; r0 += perWindow) {
    const int64_t n = std::min(perWindow, rows - r0);
    const int64_t offset = position + r0 * rowBytes;
    const int64_t base = offset / page * page;
    const size_t length = size_t(offset - base + n * rowBytes);
    void* m = mmap(nullptr, length, PROT_READ | PROT_WRITE, MAP_SHARED, fd_, off_t(base));
    if (m == MAP_FAILED) return false;
    char* dst = static_cast<char*>(m) + (offset - base);
    const char* rowsFrom = from + r0 * pitch;
#pragma omp parallel for schedule(static)
    for (int64_t r = 0; r < n; ++r) std::memcpy(dst + r * rowBytes, rowsFrom + r * pitch, size_t(rowBytes));
    if (munmap(m, length) != 0) return false;
  }
  return true;
}

int64_t RasterStream::preadv(char* const* dst, const int64_t* len, int count,
                             int64_t position) const {
  if (fd_ < 0 || count < 0 || position < 0) {
    errno = EBADF;
    return -1;
  }
  // Discarded pieces land in one scratch area; their bytes are not used.
  static thread_local std::vector<char> scratch;
  std::vector<iovec> iov(static_cast<size_t>(count));
  for (int i = 0; i < count; ++i) {
    if (!dst[i] && scratch.size() < size_t(len[i])) scratch.resize(size_t(len[i]));
  }
  for (int i = 0; i < count; ++i) {
    iov[size_t(i)].iov_base = dst[i] ? dst[i] : scratch.data();
    iov[size_t(i)].iov_len = size_t(len[i]);
  }
  ssize_t got;
  do {
    got = ::preadv(fd_, iov.data(), count, off_t(position));
  } while (got < 0 && errno == EINTR);
  return got;
}

int64_t RasterStream::size() const {
  struct stat st {};
  if (fd_ < 0 || ::fstat(fd_, &st) != 0) return -1;
  return int64_t(st.st_size);
}

bool RasterStream::truncate(int64_t bytes) const {
  if (fd_ < 0 || bytes < 0) return false;
  int rc;
  do {
    rc = ::ftruncate(fd_, off_t(bytes));
  } while (rc != 0 && errno == EINTR);
  return rc == 0;
}

bool handOverFile(const std::string& from, const std::string& to) {
  if (from == to || std::rename(from.c_str(), to.c_str()) != 0) return false;
  const int fd = ::open(from.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666);
  if (fd >= 0) ::close(fd);
  return true;
}

int host_byte_order() { return std::endian::native == std::endian::big ? 1 : 0; }

// ---- DataFile ----------------------------------------------------------------

namespace {
constexpr int kSeekSet = 0;
constexpr int kSeekCur = 1;
constexpr int kSeekEnd = 2;

int reportNotOpened(const std::string& name) {
  ORV_REPORT("File not opened!", REPORT_ERROR);
  ORV_REPORT("Raster file: " + name, REPORT_MESSAGE);
  return STATUS_NOT_OPENED;
}
int reportReadFailed(const std::string& name) {
  ORV_REPORT("File reading failed!", REPORT_ERROR);
  ORV_REPORT("Raster file: " + name, REPORT_MESSAGE);
  return STATUS_READ_FAILED;
}
int reportWriteFailed(const std::string& name) {
  ORV_REPORT("File writing failed!", REPORT_ERROR);
  ORV_REPORT("Raster file: " + name, REPORT_MESSAGE);
  return STATUS_WRITE_FAILED;
}
}  // namespace

DataFile::DataFile() { createElementsVector(6); }

DataFile::DataFile(const std::string& name) : filename(name) { createElementsVector(6); }

DataFile::DataFile(const DataFile& other) : GeneralSAR_Base() {
  copyLayout(other);
  createElementsVector(6);
}

DataFile& DataFile::operator=(const DataFile& other) {
  if (this != &other) {
    close();
    copyLayout(other);
  }
  return *this;
}

DataFile::~DataFile() { close(); }

void DataFile::copyLayout(const DataFile& other) {
  filename = other.filename;
  NrOfPixelsPerLine = other.NrOfPixelsPerLine;
  NrOfLinesPerImage = other.NrOfLinesPerImage;
  RowPrefix = other.RowPrefix;
  HeaderOffset = other.HeaderOffset;
  CellType = other.CellType;
  ByteOrder = other.ByteOrder;
  hdrname = other.hdrname;
  buffersize = 0;
}

void DataFile::refreshParameters() {
  addElementInt("NrOfLinesPerImage", &NrOfLinesPerImage, 1, 0, 2147483647, true);
  addElementInt("NrOfPixelsPerLine", &NrOfPixelsPerLine, 1, 0, 2147483647, true);
  addElementInt("HeaderOffset", &hdrOffset_, 1, 0, 2147483647, true);
  addElementInt("RowPrefix", &RowPrefix, 1, 0, 2147483647, true);
  addElementInt("ByteOrder", &ByteOrder, 1, 0, 1, true);
  addElementInt("CellType", &CellType, 1, 0, 9, true);
  setAllocationFlag(true);
}

int DataFile::open(int mode) {
  CheckedCall cc("DataFile::open()");
  if (is_open()) close();
  const char* streamMode = nullptr;
  switch (mode) {
    case 0: streamMode = "rb"; modeFlag_ = 0; break;
    case 1: streamMode = "wb"; modeFlag_ = 1; break;
    case 2: streamMode = "r+b"; modeFlag_ = 1; break;
    case 3: streamMode = "rb+"; modeFlag_ = 2; break;
    default: break;
  }
  if (streamMode) stream_.open(filename, streamMode);
  position_ = 0;
  cursor_ = 0;
  valid_ = 0;
  buffer_.reset();
  if (buffersize > 0) {
    buffer_.reset(new (std::nothrow) char[size_t(buffersize)]);
    if (!buffer_) {
      stream_.close();
      buffersize = 0;
      ORV_REPORT("Memory allocation failure", REPORT_ERROR);
      return STATUS_NO_MEMORY;
    }
  }
  if (!stream_.is_open()) {
    orv_check(errno, __LINE__, __func__, __FILE__);
    errno = 0;
    return reportNotOpened(filename);
  }
  return STATUS_OK;
}

int DataFile::flushBuffer() {
  if (valid_ <= 0) return STATUS_OK;
  const int64_t put = stream_.pwrite(buffer_.get(), valid_, position_);
  if (put != valid_) return reportWriteFailed(filename);
  return STATUS_OK;
}

int DataFile::close() {
  int status = STATUS_OK;
  if (is_open()) {
    if (is_buffered() && modeFlag_ == 1 && buffer_) status = flushBuffer();
    if (stream_.close() != 0 && status == STATUS_OK) status = reportWriteFailed(filename);
  }
  buffer_.reset();
  buffersize = 0;
  position_ = cursor_ = valid_ = 0;
  return status;
}

int DataFile::loadBuffer(int64_t target) {
  if (target < 0) return STATUS_BAD_CONDITION;
  position_ = target;
  cursor_ = 0;
  const int64_t got = stream_.pread(buffer_.get(), buffersize, target);
  valid_ = std::max<int64_t>(got, 0);
  if (got < 0) return reportReadFailed(filename);
  return STATUS_OK;
}

int DataFile::seek(int64_t offset, int whence) {
  if (!is_open()) return reportNotOpened(filename);
  if (!is_buffered() || !buffer_) {
    int64_t target;
    if (whence == kSeekSet)
      target = offset;
    else if (whence == kSeekCur)
      target = position_ + offset;
    else
      return STATUS_BAD_CONDITION;
    if (target < 0) return STATUS_BAD_CONDITION;
    position_ = target;
    return STATUS_OK;
  }
  if (modeFlag_ == 1) {
    // Buffered writing: flush, then the offset counts from the buffer's
    // first byte whatever whence says.
    const int status = flushBuffer();
    if (status != STATUS_OK) return status;
    if (position_ + offset < 0) return STATUS_BAD_CONDITION;
    position_ += offset;
    cursor_ = valid_ = 0;
    return STATUS_OK;
  }
  switch (whence) {
    case kSeekSet:
      if (offset > position_ && offset < position_ + valid_) {
        cursor_ = offset - position_;
        return STATUS_OK;
      }
      return loadBuffer(offset);
    case kSeekCur:
      if (cursor_ + offset >= 0 && cursor_ + offset < valid_) {
        cursor_ += offset;
        return STATUS_OK;
      }
      return loadBuffer(position_ + cursor_ + offset);
    case kSeekEnd: {
      const int64_t size = stream_.size();
      if (size < 0) return reportReadFailed(filename);
      return loadBuffer(size + offset);
    }
    default:
      return STATUS_BAD_CONDITION;
  }
}

int DataFile::read(void* dst, int64_t n) {
  if (!is_open()) return reportNotOpened(filename);
  if (n < 0) return STATUS_BAD_CONDITION;
  char* out = static_cast<char*>(dst);
  if (is_buffered() && buffer_) {
    if (modeFlag_ != 1) {
      while (n > 0) {
        const int64_t avail = valid_ - cursor_;
        if (avail > 0) {
          const int64_t take = std::min(avail, n);
          std::memcpy(out, buffer_.get() + cursor_, size_t(take));
          cursor_ += take;
          out += take;
          n -= take;
          continue;
        }
        const int status = loadBuffer(position_ + cursor_);
        if (status != STATUS_OK) return status;
        if (valid_ == 0) return STATUS_OK;  // end of file, tolerated
      }
      return STATUS_OK;
    }
    // Reading from a buffered writer: write the pending bytes out first.
    const int status = flushBuffer();
    if (status != STATUS_OK) return status;
    position_ += valid_;
    cursor_ = valid_ = 0;
  }
  const int64_t got = stream_.pread(out, n, position_);
  if (got > 0) position_ += got;
  if (got != n) return reportReadFailed(filename);
  return STATUS_OK;
}

int DataFile::write(const void* src, int64_t n) {
  if (!is_open()) return reportNotOpened(filename);
  if (n < 0) return STATUS_BAD_CONDITION;
  if (is_buffered() && buffer_) {
    if (modeFlag_ == 1) {
      if (cursor_ + n <= buffersize) {
        std::memcpy(buffer_.get() + cursor_, src, size_t(n));
        cursor_ += n;
        valid_ = cursor_;
        return STATUS_OK;
      }
      const int status = flushBuffer();
      if (status != STATUS_OK) return status;
      position_ += valid_;
      cursor_ = valid_ = 0;
    } else {
      // Updating through a read buffer: write in place, drop the buffer.
      position_ += cursor_;
      cursor_ = valid_ = 0;
    }
  }
  const int64_t put = stream_.pwrite(src, n, position_);
  if (put > 0) position_ += put;
  if (put != n) return reportWriteFailed(filename);
  return STATUS_OK;
}

int64_t DataFile::tell() const { return is_buffered() ? position_ + cursor_ : position_; }

bool DataFile::exists() const {
  struct stat st {};
  return ::stat(filename.c_str(), &st) == 0;
}

int DataFile::writeRows(const void* src, int64_t pitch, int64_t rowBytes, int64_t rows) {
  if (!is_open()) return reportNotOpened(filename);
  if (pitch < rowBytes || rowBytes < 0 || rows < 0 || is_buffered()) return STATUS_BAD_CONDITION;
  if (!stream_.putRowsShared(src, pitch, rowBytes, rows, position_)) return reportWriteFailed(filename);
  position_ += rows * rowBytes;
  return STATUS_OK;
}

int DataFile::write_hdr() {
  CheckedCall cc("DataFile::write_hdr()");
  hdrname = filename + ".hdr";
  if (HeaderOffset > 2147483647 || HeaderOffset < 0) {
    ORV_REPORT("HeaderOffset does not fit the RasterInfo element: " + hdrname, REPORT_ERROR);
    return STATUS_BAD_CONDITION;
  }
  hdrOffset_ = int(HeaderOffset);
  if (writeAuxiliaryFile(hdrname, 1, "RasterInfo") != 0) {
    return reportWriteFailed(hdrname);
  }
  return STATUS_OK;
}

int DataFile::read_hdr(const std::string& name) {
  CheckedCall cc("DataFile::read_hdr()");
  stream_.close();
  buffer_.reset();
  buffersize = 0;
  position_ = cursor_ = valid_ = 0;
  filename = name;
  hdrname = name + ".hdr";
  hdrOffset_ = int(HeaderOffset);
  if (readAuxiliaryFile(hdrname, 1, "RasterInfo")) {
    HeaderOffset = hdrOffset_;
    return STATUS_OK;
  }
  RasterInfoLayout layout;
  const int status = read_raster_info_profile(hdrname, layout);
  HeaderOffset = layout.HeaderOffset;
  RowPrefix = layout.RowPrefix;
  NrOfPixelsPerLine = layout.NrOfPixelsPerLine;
  NrOfLinesPerImage = layout.NrOfLinesPerImage;
  CellType = layout.CellType;
  ByteOrder = layout.ByteOrder;
  return status;
}

int DataFile::clone(DataFile* other) const {
  if (!other) return STATUS_BAD_CONDITION;
  if (other == this) return STATUS_OK;
  other->close();
  other->copyLayout(*this);
  return STATUS_OK;
}

int DataFile::copy(const std::string& newname, int chunk) {
  CheckedCall cc("DataFile::copy()");
  if (chunk <= 0 || !cell_type_valid(CellType)) return STATUS_BAD_CONDITION;
  RasterStream in, out;
  if (!in.open(filename, "rb")) return reportNotOpened(filename);
  if (!out.open(newname, "wb")) return reportNotOpened(newname);
  const int64_t total = HeaderOffset + int64_t(NrOfLinesPerImage) * rowlength();
  std::unique_ptr<char[]> piece(new (std::nothrow) char[size_t(chunk)]);
  if (!piece) return STATUS_NO_MEMORY;
  const int64_t pieces = total / chunk + 1;
  for (int64_t i = 0; i < pieces; ++i) {
    const int64_t at = i * chunk;
    const int64_t n = (i == pieces - 1) ? total - at : chunk;
    if (n <= 0) break;
    if (in.pread(piece.get(), n, at) != n) return reportReadFailed(filename);
    if (out.pwrite(piece.get(), n, at) != n) return reportWriteFailed(newname);
  }
  if (out.close() != 0) return reportWriteFailed(newname);
  DataFile target;
  clone(&target);
  target.filename = newname;
  const int status = target.write_hdr();
  if (status != STATUS_OK) ORV_REPORT_CALLED_ERROR();
  return status;
}

int DataFile::readRows(char* dst, int64_t pitch, int rows, int64_t lead, int64_t bytes,
                       int64_t trail) {
  if (!is_open()) return reportNotOpened(filename);
  const int64_t gap = lead + trail;
  const bool gather = !(is_buffered() && buffer_) && bytes > 0 && lead >= 0 && trail >= 0 &&
                      gap <= 65536 && gap * 4 <= bytes;
  int r = 0;
  if (gather) {
    // Groups of rows, at most 1 GiB and 1024 pieces per transfer.
    const int64_t span = bytes + gap;
    const int perCall = int(std::clamp<int64_t>((int64_t(1) << 30) / span, 1, 500));
    std::vector<char*> to;
    std::vector<int64_t> len;
    while (r < rows) {
      const int n = std::min(perCall, rows - r);
      to.clear();
      len.clear();
      int64_t total = 0;
      for (int i = 0; i < n; ++i) {
        const int64_t skipBytes = i == 0 ? lead : gap;
        if (skipBytes > 0) {
          to.push_back(nullptr);
          len.push_back(skipBytes);
        }
        to.push_back(dst + (r + i) * pitch);
        len.push_back(bytes);
        total += skipBytes + bytes;
      }
      const int64_t got = stream_.preadv(to.data(), len.data(), int(to.size()), position_);
      if (got != total) break;  // the row by row path below tells what went wrong
      position_ += total + trail;
      r += n;
    }
  }
  for (; r < rows; ++r) {
    int status;
    if ((lead && (status = seek(lead, kSeekCur)) != STATUS_OK) ||
        (status = read(dst + r * pitch, bytes)) != STATUS_OK ||
        (trail && (status = seek(trail, kSeekCur)) != STATUS_OK))
      return status;
  }
  return STATUS_OK;
}

void setComplexRasterLayout(DataFile& file, const std::string& name, int samples, int lines) {
  file.filename = name;
  file.NrOfPixelsPerLine = samples;
  file.NrOfLinesPerImage = lines;
  file.RowPrefix = 0;
  file.HeaderOffset = 0;
  file.CellType = FLOAT_COMPLEX;
  file.ByteOrder = 0;
}
