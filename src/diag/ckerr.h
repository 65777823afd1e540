#pragma once
#include <cstddef>
#include <string>

// Checked-call layer: call-name stack with per-depth coordinates and the
// allocation table that lets a function free everything allocated below it.
// One thread only.
int init_ckerr_locking();
int ckflg_ckerr();
int set_ckerr_fun(const char* name);
void deccurdep();
int ckerr_depth();
const char* ckerr_current_function();

void* malloc_ckerr(std::size_t size);
void* calloc_ckerr(std::size_t count, std::size_t size);
void free_ckerr(void* address);
void freeall_ckerr();
void** matalloc_ckerr(int rows, std::size_t rowBytes);
void matfree_ckerr(void** matrix, int rows);
int ckerr_live_allocations();
void exit_ckerr();

// Debug dump: three 32-bit values (type, columns, rows) then the buffer.
int write_debug(const char* path, const void* buffer, int type, int columns, int rows);

// RAII form of set_ckerr_fun / deccurdep around a call of interest.
class CheckedCall {
 public:
  explicit CheckedCall(const char* name) { set_ckerr_fun(name); }
  ~CheckedCall() { deccurdep(); }
  CheckedCall(const CheckedCall&) = delete;
  CheckedCall& operator=(const CheckedCall&) = delete;
};
