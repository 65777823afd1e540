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
