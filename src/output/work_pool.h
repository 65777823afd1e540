#pragma once
// Scratch buffers of the header text operations, borrowed from a fixed pool
// of records. A record's buffer is made or grown to kWorkPoolBufferSize bytes
// when it is taken; taking one while all are busy ends the run ("All pools
// are busy", error id 848646), or throws orvaneException before the
// environment is ready.
#include <cstddef>

inline constexpr std::size_t kWorkPoolBufferSize = 1000000;
inline constexpr int kWorkPoolRecords = 16;
inline constexpr int kWorkPoolBusyErrorId = 848646;

// Index of the record taken (first free one) with its buffer.
int tesv_work_pool_take(char** buffer, std::size_t* size);
// Gives the record back; an index not taken is ignored.
void tesv_work_pool_release(int index);
// Records now busy (for tests).
int tesv_work_pool_busy();

// A borrowed buffer, given back when the object ends.
class tesv_pool_buffer {
 public:
  tesv_pool_buffer() { index_ = tesv_work_pool_take(&data_, &size_); }
  ~tesv_pool_buffer() { tesv_work_pool_release(index_); }
  tesv_pool_buffer(const tesv_pool_buffer&) = delete;
  tesv_pool_buffer& operator=(const tesv_pool_buffer&) = delete;

  char* data() { return data_; }
  std::size_t size() const { return size_; }

 private:
  char* data_ = nullptr;
  std::size_t size_ = 0;
  int index_ = -1;
};
