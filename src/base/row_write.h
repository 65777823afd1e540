#pragma once
// Writes rows of a raster held with a row pitch straight from memory into
// the file at a given offset: one gather write per batch of rows, no copy
// through a stream buffer and no page zeroed ahead of the copy (as writing
// through a shared mapping of a freshly allocated file does).
#include <sys/types.h>
#include <sys/uio.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstdio>
#include <vector>

// Writes `rows` rows of `rowBytes`, `pitch` bytes apart from `src`, one after
// the other from byte `offset` of the file. False on any failed or short
// write (full disk, size limit).
inline bool write_rows(int fd, const void* src, long long pitch, long long rowBytes, long long rows,
                       long long offset) {
  if (rows <= 0 || rowBytes <= 0) return true;
  if (fd < 0) return false;
  const char* from = static_cast<const char*>(src);
  const long long batch = pitch == rowBytes ? rows : std::min<long long>(rows, IOV_MAX);
  std::vector<iovec> iov;
  for (long long r0 = 0; r0 < rows; r0 += batch) {
    const long long n = std::min(batch, rows - r0);
    if (pitch == rowBytes) {
      iov.assign(1, iovec{const_cast<char*>(from + r0 * pitch), static_cast<std::size_t>(n * rowBytes)});
    } else {
      iov.resize(static_cast<std::size_t>(n));
      for (long long r = 0; r < n; ++r)
        iov[static_cast<std::size_t>(r)] = {const_cast<char*>(from + (r0 + r) * pitch),
                                            static_cast<std::size_t>(rowBytes)};
    }
    long long at = offset + r0 * rowBytes;
    std::size_t first = 0;
    while (first < iov.size()) {
      const int count = static_cast<int>(std::min<std::size_t>(iov.size() - first, IOV_MAX));
      const ssize_t done = pwritev(fd, iov.data() + first, count, static_cast<off_t>(at));
      if (done < 0 && errno == EINTR) continue;
      if (done <= 0) return false;
      at += done;
      // Skip what was written; a partial row continues from where it stopped.
      std::size_t left = static_cast<std::size_t>(done);
      while (first < iov.size() && left >= iov[first].iov_len) left -= iov[first++].iov_len;
      if (left > 0) {
        iov[first].iov_base = static_cast<char*>(iov[first].iov_base) + left;
        iov[first].iov_len -= left;
      }
    }
  }
  return true;
}
