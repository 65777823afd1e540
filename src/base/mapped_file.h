#pragma once
// File mappings. A whole file mapped read-only: its bytes are read in place
// from the page cache, without a copy through a read buffer. The mapping
// ends with the object.
#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <string>

class MappedFile {
 public:
  enum Result { kMapped = 0, kNotOpened = 1, kNotMapped = 2 };

  MappedFile() = default;
  MappedFile(const MappedFile&) = delete;
  MappedFile& operator=(const MappedFile&) = delete;
  ~MappedFile() { reset(); }

  // kMapped (an empty file maps to no bytes), kNotOpened, or kNotMapped when
  // the file opened but could not be sized or mapped.
  Result open(const std::string& path) {
    reset();
    const int fd = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
    if (fd < 0) return kNotOpened;
    struct stat st {};
    Result result = kMapped;
    if (fstat(fd, &st) != 0) {
      result = kNotMapped;
    } else if (st.st_size > 0) {
      void* m = mmap(nullptr, static_cast<std::size_t>(st.st_size), PROT_READ, MAP_PRIVATE, fd, 0);
      if (m == MAP_FAILED) {
        result = kNotMapped;
      } else {
        data_ = static_cast<const unsigned char*>(m);
        size_ = static_cast<long long>(st.st_size);
      }
    }
    ::close(fd);
    return result;
  }

  void reset() {
    if (data_ != nullptr) munmap(const_cast<unsigned char*>(data_), static_cast<std::size_t>(size_));
    data_ = nullptr;
    size_ = 0;
  }

  const unsigned char* data() const { return data_; }
  long long size() const { return size_; }

 private:
  const unsigned char* data_ = nullptr;
  long long size_ = 0;
};

// A raster file written through a shared mapping, a window of rows at a
// time: the threads copy into the page cache side by side, which a single
// write call cannot do. The file is allocated before a window is mapped, so
// that a full disk or a file size limit is met as a failed allocation and
// not as a fault inside the mapping. The stream must be open for reading and
// writing (a shared mapping for writing needs both).
class MappedOutput {
 public:
  enum Reserved { kReady, kUnsupported, kFailed };

  void attach(std::FILE* f) { attach(f ? fileno(f) : -1); }
  void attach(int fd) { fd_ = fd; }

  // Allocates the file up to `end` bytes, extending it. kUnsupported when
  // the file system cannot allocate (the caller then writes through the
  // stream), kFailed for a full disk or a size limit.
  Reserved reserve(long long end) const {
    if (fd_ < 0 || end <= 0 || (fcntl(fd_, F_GETFL) & O_ACCMODE) != O_RDWR) return kUnsupported;
    if (fallocate(fd_, 0, 0, static_cast<off_t>(end)) == 0) return kReady;
    return errno == EOPNOTSUPP || errno == ENOSYS || errno == EINVAL ? kUnsupported : kFailed;
  }

  // Copies `rows` rows of rowBytes, `pitch` bytes apart in src, to the
  // reserved bytes from `offset` on, one after the other. The rows go in
  // windows of at most kWindowBytes, each unmapped before the next, so that
  // the process never holds more than a window of the file.
  bool put(const void* src, long long pitch, long long rowBytes, long long rows, long long offset) const {
    if (rows <= 0 || rowBytes <= 0) return true;
    const long long perWindow = std::max(1LL, kWindowBytes / rowBytes);
    const char* from = static_cast<const char*>(src);
    for (long long r0 = 0; r0 < rows; r0 += perWindow) {
      const long long n = std::min(perWindow, rows - r0);
      if (!putWindow(from + r0 * pitch, pitch, rowBytes, n, offset + r0 * rowBytes)) return false;
    }
    return true;
  }

 private:
  static constexpr long long kWindowBytes = 32LL << 20;

  bool putWindow(const char* from, long long pitch, long long rowBytes, long long rows, long long offset) const {
    const long long page = sysconf(_SC_PAGESIZE);
    const long long base = offset / page * page;
    const std::size_t length = static_cast<std::size_t>(offset - base + rows * rowBytes);
    void* m = mmap(nullptr, length, PROT_READ | PROT_WRITE, MAP_SHARED, fd_, static_cast<off_t>(base));
    if (m == MAP_FAILED) return false;
    char* dst = static_cast<char*>(m) + (offset - base);
#pragma omp parallel for schedule(static)
    for (long long r = 0; r < rows; ++r)
      std::memcpy(dst + r * rowBytes, from + r * pitch, static_cast<std::size_t>(rowBytes));
    return munmap(m, length) == 0;
  }

  int fd_ = -1;
};
