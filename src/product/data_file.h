#pragma once
// Raster files: a flat binary file (header block, then rows of prefix and
// pixels) with a side file named by appending ".hdr" to the file name.
// DataFile is the checked, status-returning class of the tools and the
// focusing chain; BufferIO (buffer_io.h) is its row/column accessor.
#include <cstdint>
#include <memory>
#include <string>

#include "product/cell_type.h"
#include "product/general_sar_base.h"

// Owner of an open file descriptor with 64-bit positioned transfers. Opened
// with the modes of fopen ("rb", "wb", "r+b", "rb+", "w+b"); the transfers
// never move a shared file offset, so a "seek" is position arithmetic only.
class RasterStream {
 public:
  RasterStream() = default;
  ~RasterStream() { close(); }
  RasterStream(const RasterStream&) = delete;
  RasterStream& operator=(const RasterStream&) = delete;
  RasterStream(RasterStream&& other) noexcept : fd_(other.fd_) { other.fd_ = -1; }
  RasterStream& operator=(RasterStream&& other) noexcept;

  // false (errno set) when the file cannot be opened or the mode is unknown.
  bool open(const std::string& name, const char* mode);
  // 0, or -1 when the descriptor could not be closed cleanly.
  int close();
  bool is_open() const { return fd_ >= 0; }
  // Bytes transferred (short only at end of file or on error), -1 on an
  // error before any byte moved.
  int64_t pread(void* dst, int64_t n, int64_t position) const;
  // The same read split between the threads, each copying its part out of
  // the page cache. n when every part was read whole, else -1.
  int64_t preadShared(void* dst, int64_t n, int64_t position) const;
  int64_t pwrite(const void* src, int64_t n, int64_t position) const;
  // Gather write: `rows` rows of rowBytes, `pitch` bytes apart from src, one
  // after the other from `position`, straight from memory (no stream buffer,
  // no page of the file zeroed ahead of the copy as a shared mapping of a
  // fresh file does). False on any failed or short write.
  bool pwriteRows(const void* src, int64_t pitch, int64_t rowBytes, int64_t rows, int64_t position) const;
  // The same rows copied by every thread through a shared mapping of the
  // file, a window of at most 32 MiB at a time (one writer thread fills the
  // page cache at a third of the speed of two on this kind of machine). The
  // file is allocated first, so that a full disk or a size limit fails here
  // and not as a fault inside the mapping. Needs the stream open for reading
  // and writing; where the file system cannot allocate, the rows go through
  // pwriteRows.
  bool putRowsShared(const void* src, int64_t pitch, int64_t rowBytes, int64_t rows, int64_t position) const;
  // Current size of the file, -1 on error.
  int64_t size() const;
  // Cuts or extends the file to `bytes`; false on error.
  bool truncate(int64_t bytes) const;
  // Scatter read: `count` pieces of lengths len[i] into dst[i] (a null dst
  // discards the piece), starting at `position`, in one call. Bytes read, -1
  // on error.
  int64_t preadv(char* const* dst, const int64_t* len, int count, int64_t position) const;
  int fd() const { return fd_; }

 private:
  int fd_ = -1;
};

// Gives the file `from` the name `to` (replacing any file of that name) and
// leaves an empty file named `from`, so that a stage can write its output
// over the input it has already read: the pages of the page cache are
// reused, where a fresh file costs a page fault and a cleared page per 4 KiB
// written (on a virtual machine, a second of system time per GB or more).
// For temporaries the job erases by name at its end. False, with nothing
// changed, when the rename fails.
bool handOverFile(const std::string& from, const std::string& to);

// Host byte order as the ByteOrder code of a raster: 0 little-endian, 1 big.
int host_byte_order();

class DataFile : public GeneralSAR_Base {
 public:
  DataFile();
  explicit DataFile(const std::string& name);
  // Copies name and layout; the copy is closed and unbuffered.
  DataFile(const DataFile& other);
  DataFile& operator=(const DataFile& other);
  ~DataFile() override;

  // Layout, filled by the caller before open() or by read_hdr().
  std::string filename;
  int NrOfPixelsPerLine = 0;
  int NrOfLinesPerImage = 0;
  int RowPrefix = 0;
  int64_t HeaderOffset = 0;
  int CellType = FLOAT_COMPLEX;
  int ByteOrder = 0;  // 0 little-endian file, 1 big-endian file
  // Buffer size in bytes, 0 = unbuffered; the buffer is allocated by open()
  // and close() sets this back to 0.
  int64_t buffersize = 0;
  std::string hdrname;  // side file name set by read_hdr/write_hdr

  // Modes: 0 "rb" (reading), 1 "wb" (writing), 2 "r+b" (writing),
  // 3 "rb+" (updating). 9 "File not opened!", 7 out of memory.
  int open(int mode);
  // Flushes, frees the buffer, closes. 0 when already closed, 5 when the
  // flush failed.
  int close();
  bool is_open() const { return stream_.is_open(); }
  bool is_buffered() const { return buffersize > 0; }
  bool is_writing() const { return modeFlag_ == 1; }
  bool is_complex() const { return cell_type_complex(CellType); }
  // whence: SEEK_SET 0, SEEK_CUR 1, SEEK_END 2 (buffered reading only).
  // While writing buffered, the buffer is flushed and the offset is taken
  // from the buffer's first byte whatever whence says.
  int seek(int64_t offset, int whence);
  // 4 "File reading failed!" on a short unbuffered read; a buffered read
  // stops silently at end of file.
  int read(void* dst, int64_t n);
  // 5 "File writing failed!" on a short write.
  int write(const void* src, int64_t n);
  // `rows` rows of rowBytes, `pitch` bytes apart from src, written at the
  // current position by every thread (RasterStream::putRowsShared: the file
  // open with mode 2, unbuffered). 5 "File writing failed!" on failure.
  int writeRows(const void* src, int64_t pitch, int64_t rowBytes, int64_t rows);
  int64_t tell() const;
  // Pixel size of CellType (0 for a number outside 0..9).
  int element_sizeof() const { return cell_type_size(CellType); }
  bool exists() const;
  // Writes the element document RasterInfo into filename + ".hdr".
  int write_hdr();
  // Reads filename's side file: element document first, profile form as
  // fallback. 1 for a missing key or an unknown cell type text (CellType -1).
  int read_hdr(const std::string& name);
  // Makes `other` a closed copy of this raster's name and layout.
  int clone(DataFile* other) const;
  // Copies HeaderOffset + rows * row length bytes into newname in pieces of
  // `chunk` bytes and writes its side file.
  int copy(const std::string& newname, int chunk);
  // `rows` times: skip `lead` bytes, read `bytes` bytes into dst (rows
  // `pitch` bytes apart), skip `trail` bytes; the same as the seek/read/seek
  // sequence, with rows gathered into few transfers when the file is
  // unbuffered and the gaps are small.
  int readRows(char* dst, int64_t pitch, int rows, int64_t lead, int64_t bytes, int64_t trail);

  // Bytes of one row: prefix plus pixels.
  int64_t rowlength() const {
    return RowPrefix + int64_t(NrOfPixelsPerLine) * cell_type_size(CellType);
  }
  // Start of row r.
  int64_t rowstart(int64_t r) const { return HeaderOffset + r * rowlength(); }
  // 0 reading, 1 writing, 2 updating.
  int getModeFlag() const { return modeFlag_; }
  const RasterStream& stream() const { return stream_; }

  void refreshParameters() override;
  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override {
    setAllocationFlag(false);
    return 0;
  }
  using GeneralSAR_Base::readhdr;
  using GeneralSAR_Base::writehdr;

 private:
  int flushBuffer();
  int loadBuffer(int64_t target);
  void copyLayout(const DataFile& other);

  int64_t position_ = 0;  // file position; first byte of the buffer when buffered
  int64_t cursor_ = 0;    // inside the buffer
  int64_t valid_ = 0;     // bytes valid in the buffer
  std::unique_ptr<char[]> buffer_;
  int modeFlag_ = 0;
  RasterStream stream_;
  int hdrOffset_ = 0;  // 32-bit view of HeaderOffset for the element table
};

// Layout of a focused or range-focused raster: complex floats in host
// little-endian order, no header block, no row prefixes; `name`, `samples`
// per line, `lines`.
void setComplexRasterLayout(DataFile& file, const std::string& name, int samples, int lines);
