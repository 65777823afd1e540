#pragma once
#include <cstddef>
#include <new>
#include <string>
#include <vector>

#include "base/fcomplex.h"

// Thin layer over FFTW (single precision) that gives every kernel the same
// view of a transform: row-major fcomplex arrays with rows of `nx` samples,
// a plan made once and run many times, per-axis direction codes that also say
// whether to normalise, and transforms over the top-left `ux` x `uy`
// rectangle of a larger array.
//
// Direction codes of an axis:
//    0  no transform on this axis
//    1  forward, kernel exp(-j 2 pi n k / N), no scaling
//   -1  backward, kernel exp(+j 2 pi n k / N), then scale by 1/N
//   -2  backward, no scaling
//
// FFTW plans live in a process-wide cache keyed by geometry, direction,
// placement, alignment and thread count, so making the same plan twice costs
// a map look-up. Plan records are plain values: copy them freely; releasing
// one never invalidates another.

enum FFTDirection : int {
  FFT_NONE = 0,
  FFT_FORWARD = 1,
  FFT_BACKWARD_NORMALISED = -1,
  FFT_BACKWARD = -2,
};

struct FFTPlan {
  void* row = nullptr;  // row handle (null: no transform along rows)
  int nx = 0;           // row length = stride between rows
  int ux = 0;           // used length along a row
  int rowNormalise = 0;
  int rowDirection = 0;  // 1 forward, -1 backward
  void* col = nullptr;   // column handle (null: no transform along columns)
  int ny = 0;
  int uy = 0;  // used length along a column
  int colNormalise = 0;
  int colDirection = 0;
  int inPlace = 0;
};

// Chirp-z plan: forward and normalised backward transforms of length L, the
// input length M and the output length K.
struct CZTPlan {
  FFTPlan forward;
  FFTPlan backward;
  int M = 0;
  int K = 0;
  int L = 0;
};

// Plan for real input along rows: rows of `nx` floats (the used `ux` of them)
// transform to rows of nx/2+1 fcomplex (the used ux/2+1 of them); the column
// transform, when asked, runs on the complex half-spectrum. Backward goes the
// other way. Kept for completeness; no focusing step uses it.
struct FFTPlanR {
  void* row = nullptr;
  void* col = nullptr;
  int nx = 0, ux = 0, ny = 0, uy = 0;
  int rowNormalise = 0, rowDirection = 0;
  int colNormalise = 0, colDirection = 0;
  int inPlace = 0;
};

// Status: 0; 1 nx or ny below 1; 2 ux > nx; 3 uy > ny; 4 row handle could not
// be made; 5 column handle could not be made. (Also 1 for a used length below
// 1 or an unknown direction code.)
int fft_makep_c(FFTPlan& plan, int nx, int ux, int ny, int uy, int rowDirection,
                int colDirection, int inPlace);
// Runs the plan: rows from `in` to `out`, then columns from `out` (or from
// `in` when there was no row step) to `out`, then the normalisation of the
// rectangle. `in` may equal `out` whatever the placement of the plan. Samples
// outside the rectangle are left as they are.
int pfft_c(const FFTPlan& plan, const fcomplex* in, fcomplex* out);
int fft_destp_c(FFTPlan& plan);
// One-shot: make (in place when in == out), run, release.
int fft_c(int nx, int ux, int ny, int uy, int rowDirection, int colDirection, const fcomplex* in,
          fcomplex* out);

// Real set. `in`/`out` are float or fcomplex according to the direction of
// the row step (forward: float in, fcomplex out; backward: fcomplex in,
// float out). Out-of-place only (the in-place flag is accepted and ignored).
int fft_makep_r(FFTPlanR& plan, int nx, int ux, int ny, int uy, int rowDirection,
                int colDirection, int inPlace);
int pfft_r(const FFTPlanR& plan, const void* in, void* out);
int fft_destp_r(FFTPlanR& plan);
int fft_r(int nx, int ux, int ny, int uy, int rowDirection, int colDirection, const void* in,
          void* out);

// First value v >= n in steps of `step` whose only prime factors are 2, 3 and
// 5, never 5625 (the search restarts at 5626 when it lands there). 0 when n
// is not positive.
int genpow(int n, int step = 1);

// In-place swap of half-rows (rotation by n/2 for odd n) on `rows` rows of
// length n; ifftshift is the inverse.
void fftshift(fcomplex* data, int n, int rows = 1);
void ifftshift(fcomplex* data, int n, int rows = 1);

// Chirp-z transform, per row: X[k] = sum_n x[n] exp(j n (a k - b)),
// k = 0..K-1, input rows packed with stride M and output rows with stride K.
int czt_makep_c(CZTPlan& plan, int M, int K);
int pczt_c(const CZTPlan& plan, const fcomplex* in, fcomplex* out, double a, double b, int rows);
int czt_destp_c(CZTPlan& plan);
int czt_c(const fcomplex* in, int M, fcomplex* out, int K, double a, double b, int rows);

// Aligned blocks (at least 16 bytes; 64 in practice) for transform buffers.
void* fft_malloc(std::size_t bytes);
void* fft_calloc(std::size_t count, std::size_t size);
void fft_free(void* p);

// Allocator of transform buffers in standard containers.
template <class T>
struct FFTAllocator {
  using value_type = T;
  FFTAllocator() = default;
  template <class U>
  FFTAllocator(const FFTAllocator<U>&) noexcept {}
  T* allocate(std::size_t n) {
    if (n > static_cast<std::size_t>(-1) / sizeof(T)) throw std::bad_array_new_length();
    void* p = fft_malloc(n * sizeof(T));
    if (!p) throw std::bad_alloc();
    return static_cast<T*>(p);
  }
  void deallocate(T* p, std::size_t) noexcept { fft_free(p); }
  template <class U>
  bool operator==(const FFTAllocator<U>&) const noexcept { return true; }
};
using FFTBuffer = std::vector<fcomplex, FFTAllocator<fcomplex>>;

// Threads used by the transforms; 0 or below means every core (the default,
// also taken from TESSIVOR_FFT_THREADS when set). Small transforms run on one
// thread whatever this says.
void fft_set_threads(int threads);
int fft_get_threads();

// Planning: FFTW_ESTIMATE by default. When TESSIVOR_FFTW_WISDOM names a
// file, its wisdom is imported on first use, plans it lacks are measured
// (FFTW_MEASURE on scratch arrays, batches up to 128 MiB) and the file is
// rewritten, so only the first run on a machine pays for measuring.
// fft_set_measure(true) measures without a file.
bool fft_import_wisdom(const std::string& path);
bool fft_export_wisdom(const std::string& path);
void fft_set_measure(bool measure);
// Releases every cached plan (records made before become invalid).
void fft_cleanup();
// Transform ledger, for the frame benchmarks: when TESSIVOR_FFT_LEDGER names a
// file, every executed transform is counted by its geometry (length, batch,
// strides, direction, threads, placement, alignment) with the steady-clock
// times of its first and last execution, and the counts are written to the
// file when the plans are released (fft_cleanup or exit).
