#pragma once
// BufferFile: the self-contained window-buffered raster class of the
// extractors, the raw-data cutter and the multi-looker. A large window keeps
// seeks of a few bytes in memory: in read mode with a back-reach kept when
// the window moves forward, in write and update mode as a read-modify-write
// page. Operations return nothing or a byte count and report no errors; a
// failed open leaves no stream and every typed operation then does nothing.
#include <cstdint>
#include <memory>
#include <string>

#include "base/fcomplex.h"
#include "product/data_file.h"
#include "product/general_sar_base.h"

class BufferFile : public GeneralSAR_Base {
 public:
  // Cell types, numbered as the CellType element.
  enum UnitType : int {
    FLOAT_COMPLEX = 0,
    FLOAT32 = 1,
    DOUBLE_COMPLEX = 2,
    FLOAT64 = 3,
    INT32_COMPLEX = 4,
    INT32 = 5,
    SHORT_COMPLEX = 6,
    INT16 = 7,
    INT8_COMPLEX = 8,
    INT8 = 9,
    UNDEFINED = 10  // not yet described: no pixel size
  };
  // 1 "rb", 2 "w+b", 3 "r+b"; any other value opens nothing.
  enum OperationType : int { NOT_OPEN = 0, READ = 1, WRITE = 2, UPDATE = 3 };
  enum SeekType : int { FROM_START = 0, FROM_CURRENT = 1, FROM_END = 2 };

  BufferFile();
  explicit BufferFile(const std::string& name);
  ~BufferFile() override;
  BufferFile(const BufferFile&) = delete;
  BufferFile& operator=(const BufferFile&) = delete;

  // Element document RasterInfo of filename + ".hdr"; 0 read, 1 not.
  int readhdr();
  // Element document RasterInfo of the side file `file`; 0 read, 1 not.
  int readhdr(const std::string& file) override;
  int writehdr() override;
  int writehdr(const std::string& file) override;

  void setFilename(const std::string& name) { filename_ = name; }
  const std::string& getFilename() const { return filename_; }

  // true when a stream was opened.
  bool open(OperationType op);
  // Flushes the window of a writer and closes; the window is freed.
  void close();
  // Allocates a zeroed window of `size` bytes; read and update mode load the
  // first window at once. `back` (bytes kept behind the cursor when the
  // window moves) is used in read mode only.
  void initbuffer(int64_t size, int64_t back);
  // Bytes delivered / taken.
  int64_t read(void* dst, int64_t n);
  int64_t write(const void* src, int64_t n);
  void seek(int64_t offset, SeekType whence);
  int64_t tell() const;

  bool is_writing() const { return opType_ == WRITE || opType_ == UPDATE; }
  bool is_open() const { return stream_.is_open(); }
  bool is_buffered() const { return windowSize_ > 0; }
  int pixelsizeof() const { return cell_type_size(cellType_); }
  bool is_complex() const { return cell_type_complex(cellType_); }
  bool exists() const;

  void setSamples(int samples) { NrOfPixelsPerLine_ = samples; }
  void setLines(int lines) { NrOfLinesPerImage_ = lines; }
  void setRowPrefix(int prefix) { RowPrefix_ = prefix; }
  void setType(UnitType type) { cellType_ = type; }
  void setType(int type) { cellType_ = type; }
  void setByteOrder(int order) { ByteOrder_ = order; }
  void setOffsetSize(int64_t offset) { HeaderOffset_ = offset; }
  int getSamples() const { return NrOfPixelsPerLine_; }
  int getLines() const { return NrOfLinesPerImage_; }
  int getRowPrefix() const { return RowPrefix_; }
  int64_t getOffsetSize() const { return HeaderOffset_; }
  UnitType getType() const { return UnitType(cellType_); }
  int getFileEndian() const { return ByteOrder_; }
  OperationType getOpType() const { return opType_; }

  // Bytes of one row (prefix and pixels) and start of row r.
  int64_t rowlength() const { return RowPrefix_ + int64_t(NrOfPixelsPerLine_) * pixelsizeof(); }
  int64_t rowstart(int64_t r) const { return HeaderOffset_ + r * rowlength(); }

  // Blocks of `rows` rows from firstRow, `columns` pixels from firstColumn
  // (0 columns: the whole row), packed in the caller's buffer. Complex forms
  // serve files of types 0, 2, 4, 6, real forms types 1, 3, 5, 7. Returns the
  // file bytes moved (0 when the type does not fit or nothing is open).
  int64_t readbuffer(float* buf, int firstRow, int rows, int firstColumn, int columns);
  int64_t readbuffer(double* buf, int firstRow, int rows, int firstColumn, int columns);
  int64_t readbuffer(int* buf, int firstRow, int rows, int firstColumn, int columns);
  int64_t readbuffer(short* buf, int firstRow, int rows, int firstColumn, int columns);
  int64_t readbuffer(fcomplex* buf, int firstRow, int rows, int firstColumn, int columns);
  int64_t readbuffer(dcomplex* buf, int firstRow, int rows, int firstColumn, int columns);
  int64_t writebuffer(const float* buf, int firstRow, int rows, int firstColumn, int columns);
  int64_t writebuffer(const double* buf, int firstRow, int rows, int firstColumn, int columns);
  int64_t writebuffer(const int* buf, int firstRow, int rows, int firstColumn, int columns);
  int64_t writebuffer(const short* buf, int firstRow, int rows, int firstColumn, int columns);
  int64_t writebuffer(const fcomplex* buf, int firstRow, int rows, int firstColumn, int columns);
  int64_t writebuffer(const dcomplex* buf, int firstRow, int rows, int firstColumn, int columns);
  // RowPrefix bytes of each row, consecutive in the caller's buffer.
  int64_t readprefix(char* buf, int firstRow, int rows);
  int64_t writeprefix(const char* buf, int firstRow, int rows);
  // Writes the block at the current position, seeks back there and takes
  // its length as HeaderOffset.
  void writeOffset(const char* block, int length);

  // One pixel of an open little-endian file of exactly this type, else 0.
  float readFloat(int row, int column);
  double readDouble(int row, int column);
  int readInt(int row, int column);
  short readShort(int row, int column);
  fcomplex readFloatComplex(int row, int column);
  dcomplex readDoubleComplex(int row, int column);

  // Closes `other` and gives it this raster's name and layout.
  void clone(BufferFile* other) const;
  // Copies HeaderOffset + rows * row length bytes into newname in pieces of
  // `chunk` bytes and writes its side file. Returns the bytes copied.
  int64_t copy(const std::string& newname, int chunk);

  void refreshParameters() override;
  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override {
    setAllocationFlag(false);
    return 0;
  }

 private:
  int64_t transfer(void* memory, int memType, bool complexForm, int firstRow, int rows,
                   int firstColumn, int columns, bool writing);
  int64_t prefixes(char* buf, int firstRow, int rows, bool writing);
  template <typename T>
  T readPoint(int row, int column, int type);
  void flushWindow();
  void loadWriteWindow(int64_t target);
  int64_t fileSize() const;

  std::string filename_;
  int NrOfLinesPerImage_ = 0;
  int NrOfPixelsPerLine_ = 0;
  int RowPrefix_ = 0;
  int64_t HeaderOffset_ = 0;
  RasterStream stream_;
  int cellType_ = UNDEFINED;
  int ByteOrder_ = 0;
  OperationType opType_ = NOT_OPEN;
  // Read mode: file offset just after the window's valid bytes.
  // Write and update mode: file offset of the window's first byte.
  int64_t position_ = 0;
  std::unique_ptr<char[]> window_;
  int64_t windowSize_ = 0;
  int64_t back_ = 0;
  int64_t cursor_ = 0;
  int64_t valid_ = 0;
  int hdrOffset_ = 0;  // 32-bit views for the element table
};
