// Checked-call layer: the call-name stack with its per-depth coordinates and
// the allocation table that lets a function free everything allocated below
// it. One thread only, as the rest of the program.
#include "diag/ckerr.h"

#include <array>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include "base/status.h"
#include "diag/environment.h"
#include "diag/report.h"

namespace {

constexpr int kMaxDepth = 64;        // entries of the call-name stack
constexpr int kTableSize = 1024;     // live entries of the allocation table
constexpr std::size_t kNameBytes = 128;
constexpr std::size_t kAlignment = 16;

using Coordinates = std::array<std::uint16_t, kMaxDepth>;

struct Allocation {
  void* address = nullptr;
  int depth = 0;
  Coordinates coordinates{};
  std::string function;
};

struct CkerrState {
  int active = 0;
  int depth = 0;
  int excessDepth = 0;  // nested calls beyond the stack, counted but not recorded
  Coordinates coordinates{};
  std::array<std::string, kMaxDepth> names;
  std::vector<Allocation> table;
};

CkerrState& state() {
  static CkerrState s;
  return s;
}

std::string truncatedName(const char* name) {
  if (!name) return {};
  return std::string(name, strnlen(name, kNameBytes - 1));
}

// Block layout: the returned address is the block start rounded up to a
// multiple of 16, strictly past it; the word before it keeps the start.
void* alignedFromBlock(void* block) {
  if (!block) return nullptr;
  auto start = reinterpret_cast<std::uintptr_t>(block);
  std::uintptr_t aligned = (start + kAlignment) & ~(static_cast<std::uintptr_t>(kAlignment) - 1);
  auto* result = reinterpret_cast<void*>(aligned);
  std::memcpy(static_cast<char*>(result) - sizeof(void*), &block, sizeof(void*));
  return result;
}

void releaseAligned(void* address) {
  if (!address) return;
  void* block = nullptr;
  std::memcpy(&block, static_cast<char*>(address) - sizeof(void*), sizeof(void*));
  std::free(block);
}

bool tableHasRoom() {
  if (state().table.size() < static_cast<std::size_t>(kTableSize)) return true;
  ORV_REPORT("Allocation table full: more than 1024 live checked allocations, allocation refused",
             REPORT_ERROR);
  return false;
}

void record(void* address) {
  CkerrState& s = state();
  Allocation entry;
  entry.address = address;
  entry.depth = s.depth;
  entry.coordinates = s.coordinates;
  entry.function = s.names[s.depth];
  s.table.push_back(std::move(entry));
}

// Releases the entry at index and moves the last entry into its place.
void removeEntry(std::size_t index) {
  CkerrState& s = state();
  releaseAligned(s.table[index].address);
  s.table[index] = std::move(s.table.back());
  s.table.pop_back();
}

bool allocatedBelowCurrentCall(const Allocation& entry) {
  const CkerrState& s = state();
  for (int d = s.depth; d >= 1; --d)
    if (entry.coordinates[d] != s.coordinates[d]) return false;
  return true;
}

}  // namespace

int init_ckerr_locking() {
  CkerrState& s = state();
  if (s.active) return 0;
  s.active = 1;
  s.depth = 0;
  s.excessDepth = 0;
  s.coordinates.fill(0);
  for (auto& n : s.names) n.clear();
  s.names[0] = "main()";
  s.table.clear();
  return 0;
}

int ckflg_ckerr() { return state().active; }

int set_ckerr_fun(const char* name) {
  CkerrState& s = state();
  if (!s.active) return 1;
  if (s.excessDepth > 0 || s.depth + 1 >= kMaxDepth) {
    if (s.excessDepth++ == 0)
      ORV_REPORT("Call-name stack full: more than 63 nested checked calls, entering " +
                     truncatedName(name) + " is not recorded",
                 REPORT_ERROR);
    return 1;
  }
  ++s.depth;
  ++s.coordinates[s.depth];
  s.names[s.depth] = truncatedName(name);
  return 1;
}

void deccurdep() {
  CkerrState& s = state();
  if (!s.active) return;
  if (s.excessDepth > 0) {
    --s.excessDepth;
    return;
  }
  if (s.depth == 0) {
    ORV_REPORT("Call-name stack underflow: more returns than checked calls", REPORT_ERROR);
    return;
  }
  --s.depth;
}

int ckerr_depth() { return state().depth; }

const char* ckerr_current_function() { return state().names[state().depth].c_str(); }

void* malloc_ckerr(std::size_t size) {
  CkerrState& s = state();
  if (s.active && !tableHasRoom()) return nullptr;
  void* result = size > SIZE_MAX - kAlignment ? nullptr : alignedFromBlock(std::malloc(size + kAlignment));
  if (s.active) record(result);
  return result;
}

void* calloc_ckerr(std::size_t count, std::size_t size) {
  CkerrState& s = state();
  if (s.active && !tableHasRoom()) return nullptr;
  void* result = nullptr;
  if (size == 0 || count <= (SIZE_MAX - kAlignment) / size)
    result = alignedFromBlock(std::calloc(1, count * size + kAlignment));
  if (s.active) record(result);
  return result;
}

void free_ckerr(void* address) {
  CkerrState& s = state();
  if (!s.active) {
    releaseAligned(address);
    return;
  }
  for (std::size_t i = 0; i < s.table.size(); ++i) {
    if (s.table[i].address == address) {
      removeEntry(i);
      return;
    }
  }
}

void freeall_ckerr() {
  CkerrState& s = state();
  if (!s.active) return;
  // Each removal reorders the table, so the search starts again from the first.
  bool removed = true;
  while (removed) {
    removed = false;
    for (std::size_t i = 0; i < s.table.size(); ++i) {
      if (allocatedBelowCurrentCall(s.table[i])) {
        removeEntry(i);
        removed = true;
        break;
      }
    }
  }
}

void** matalloc_ckerr(int rows, std::size_t rowBytes) {
  std::size_t count = rows > 0 ? static_cast<std::size_t>(rows) : 0;
  auto** matrix = static_cast<void**>(malloc_ckerr(count * sizeof(void*)));
  if (!matrix) return nullptr;
  for (std::size_t i = 0; i < count; ++i) {
    matrix[i] = calloc_ckerr(1, rowBytes);
    if (!matrix[i]) return nullptr;
  }
  return matrix;
}

void matfree_ckerr(void** matrix, int rows) {
  if (!matrix) return;
  for (int i = 0; i < rows; ++i) free_ckerr(matrix[i]);
  free_ckerr(matrix);
}

int ckerr_live_allocations() { return static_cast<int>(state().table.size()); }

void exit_ckerr() {
  CkerrState& s = state();
  if (!s.active) return;
  if (!s.table.empty()) {
    std::fprintf(stderr, "\nPotential memory leaks detected!\n");
    std::fprintf(stderr, "\n%d buffers left to be de-allocated.!\n", static_cast<int>(s.table.size()));
    std::fprintf(stderr, "--------------------------------\n");
    std::fprintf(stderr, "ML call graph coordinates: \n");
    for (const Allocation& entry : s.table) {
      std::fprintf(stderr, "%s : ", entry.function.c_str());
      for (int d = 0; d <= entry.depth; ++d) std::fprintf(stderr, "%d\t", entry.coordinates[d]);
      std::fprintf(stderr, "\n");
    }
    for (const Allocation& entry : s.table) releaseAligned(entry.address);
  }
  s = CkerrState{};
  // The run is closed as successful here without writing the logs: the entry
  // writes the final status itself, or takes the fatal path.
  finishRun(0, false, false);
}

int write_debug(const char* path, const void* buffer, int type, int columns, int rows) {
  // Bytes of one cell of each raster cell type.
  static constexpr int kCellBytes[] = {8, 4, 16, 8, 8, 4, 4, 2, 2, 1};
  if (type < 0 || type >= static_cast<int>(std::size(kCellBytes)) || columns < 0 || rows < 0) {
    ORV_REPORT("write_debug: unknown cell type or negative size for " + std::string(path ? path : ""),
               REPORT_ERROR);
    return STATUS_BAD_PARAMETER;
  }
  std::unique_ptr<FILE, int (*)(FILE*)> file(std::fopen(path, "wb"), &std::fclose);
  if (!file) {
    ORV_REPORT("File not opened! " + std::string(path ? path : ""), REPORT_ERROR);
    return 9;
  }
  const std::int32_t head[3] = {type, columns, rows};
  std::size_t bytes = static_cast<std::size_t>(columns) * rows * kCellBytes[type];
  if (std::fwrite(head, sizeof(head), 1, file.get()) != 1 ||
      (bytes > 0 && std::fwrite(buffer, 1, bytes, file.get()) != bytes)) {
    ORV_REPORT("File writing failed! " + std::string(path), REPORT_ERROR);
    return 5;
  }
  return 0;
}
