#include "core/fft.h"
#include "base/status.h"

#include <fftw3.h>
#include <sys/mman.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <map>
#include <memory>
#include <mutex>
#include <thread>
#include <tuple>
#include <vector>

namespace {

// Kinds of one-dimensional batched transform held in the cache.
enum class Kind : int { C2C = 0, R2C = 1, C2R = 2 };

// Geometry of one batched transform along one axis.
struct AxisKey {
  Kind kind;
  int n;        // transform length
  int howmany;  // number of transforms
  int istride, idist, ostride, odist;
  int sign;  // FFTW_FORWARD or FFTW_BACKWARD
  int threads;
  bool operator<(const AxisKey& o) const {
    return std::tie(kind, n, howmany, istride, idist, ostride, odist, sign, threads) <
           std::tie(o.kind, o.n, o.howmany, o.istride, o.idist, o.ostride, o.odist, o.sign,
                    o.threads);
  }
};

// A cached axis transform with its four FFTW variants, made on demand:
// [in place][aligned]. Entries live until fft_cleanup().
struct AxisEntry {
  AxisKey key{};
  // Written under the service mutex, read without it by running transforms.
  std::atomic<fftwf_plan> variant[2][2] = {{nullptr, nullptr}, {nullptr, nullptr}};
  // Ledger of executions of each variant (counted only when the ledger is on):
  // how many, and the monotonic clock of the first and the last, in ns.
  std::atomic<long long> runs[2][2] = {{0, 0}, {0, 0}};
  std::atomic<long long> first[2][2] = {{0, 0}, {0, 0}};
  std::atomic<long long> last[2][2] = {{0, 0}, {0, 0}};
};

// Set once when TESSIVOR_FFT_LEDGER names a file: every executed transform is
// then counted by geometry, and the counts are written to the file when the
// plans are released.
std::atomic<bool> ledgerOn{false};

long long monotonicNs() {
  return std::chrono::duration_cast<std::chrono::nanoseconds>(
             std::chrono::steady_clock::now().time_since_epoch())
      .count();
}

struct Service {
  std::mutex mutex;  // FFTW's planner is not thread safe
  std::map<AxisKey, std::unique_ptr<AxisEntry>> cache;
  int threads = 0;  // 0: every core
  bool measure = false;
  bool threadsReady = false;
  bool wisdomTried = false;
  std::string wisdomPath;  // rewritten after each newly measured plan
  std::string ledgerPath;  // transform ledger, empty: none
  // One line per executed variant: kind (0 complex, 1 real forward, 2 real
  // backward), length, count per execution, strides and distances, sign,
  // threads, in place, aligned, executions, first and last execution (ns of
  // the monotonic clock).
  void writeLedger() {
    if (ledgerPath.empty()) return;
    std::ofstream out(ledgerPath, std::ios::app);
    for (const auto& [key, entry] : cache)
      for (int ip = 0; ip < 2; ++ip)
        for (int al = 0; al < 2; ++al) {
          const long long runs = entry->runs[ip][al].load();
          if (runs == 0) continue;
          out << static_cast<int>(key.kind) << ' ' << key.n << ' ' << key.howmany << ' '
              << key.istride << ' ' << key.idist << ' ' << key.ostride << ' ' << key.odist
              << ' ' << key.sign << ' ' << key.threads << ' ' << ip << ' ' << al << ' ' << runs
              << ' ' << entry->first[ip][al].load() << ' ' << entry->last[ip][al].load()
              << '\n';
        }
  }
  void destroyPlans() {
    writeLedger();
    for (auto& [key, entry] : cache)
      for (auto& inner : entry->variant)
        for (auto& p : inner)
          if (fftwf_plan q = p.load()) fftwf_destroy_plan(q);
    cache.clear();
  }
  // At exit: the plans and FFTW's own tables go too.
  ~Service() {
    destroyPlans();
    if (threadsReady) fftwf_cleanup_threads();
  }
};

Service& service() {
  static Service s;
  return s;
}

int coreCount() {
  unsigned n = std::thread::hardware_concurrency();
  return n == 0 ? 1 : static_cast<int>(n);
}

int configuredThreads(Service& s) {
  if (s.threads > 0) return s.threads;
  if (const char* env = std::getenv("TESSIVOR_FFT_THREADS")) {
    int v = std::atoi(env);
    if (v > 0) return v;
  }
  return coreCount();
}

// Called with the mutex held.
void prepareService(Service& s) {
  if (!s.threadsReady) {
    fftwf_init_threads();
    s.threadsReady = true;
  }
  if (!s.wisdomTried) {
    s.wisdomTried = true;
    if (const char* path = std::getenv("TESSIVOR_FFTW_WISDOM")) {
      if (*path) {
        // A wisdom file makes measuring worth its cost: it is paid once.
        fftwf_import_wisdom_from_filename(path);
        s.wisdomPath = path;
        s.measure = true;
      }
    }
    if (const char* path = std::getenv("TESSIVOR_FFT_LEDGER")) {
      if (*path) {
        s.ledgerPath = path;
        std::ofstream(path, std::ios::trunc)
            << "# kind n howmany istride idist ostride odist sign threads inplace aligned runs "
               "first_ns last_ns\n";
        ledgerOn.store(true);
      }
    }
  }
}

struct FftwFree {
  void operator()(void* p) const { fftwf_free(p); }
};
using FftwBuffer = std::unique_ptr<void, FftwFree>;

std::size_t extentOf(int n, int howmany, int stride, int dist) {
  return static_cast<std::size_t>(howmany - 1) * static_cast<std::size_t>(dist) +
         static_cast<std::size_t>(n - 1) * static_cast<std::size_t>(stride) + 1;
}

constexpr std::size_t kMeasureLimit = std::size_t(128) << 20;

// Makes one FFTW plan for the key. ESTIMATE and wisdom-only planning never
// touch the arrays, so small dummy arrays stand in for the caller's data;
// measuring works on scratch arrays of the full extent.
fftwf_plan createVariant(Service& s, const AxisKey& k, bool inPlace, bool aligned) {
  const int n[1] = {k.n};
  fftwf_plan_with_nthreads(k.threads);
  unsigned base = aligned ? 0u : FFTW_UNALIGNED;
  if (k.kind == Kind::C2R) base |= FFTW_DESTROY_INPUT;

  auto plan = [&](void* in, void* out, unsigned flags) -> fftwf_plan {
    switch (k.kind) {
      case Kind::C2C:
        return fftwf_plan_many_dft(1, n, k.howmany, static_cast<fftwf_complex*>(in), nullptr,
                                   k.istride, k.idist, static_cast<fftwf_complex*>(out), nullptr,
                                   k.ostride, k.odist, k.sign, flags);
      case Kind::R2C:
        return fftwf_plan_many_dft_r2c(1, n, k.howmany, static_cast<float*>(in), nullptr,
                                       k.istride, k.idist, static_cast<fftwf_complex*>(out),
                                       nullptr, k.ostride, k.odist, flags);
      case Kind::C2R:
        return fftwf_plan_many_dft_c2r(1, n, k.howmany, static_cast<fftwf_complex*>(in), nullptr,
                                       k.istride, k.idist, static_cast<float*>(out), nullptr,
                                       k.ostride, k.odist, flags);
    }
    return nullptr;
  };

  FftwBuffer dummyIn(fftwf_malloc(64)), dummyOut(fftwf_malloc(64));
  if (!dummyIn || !dummyOut) return nullptr;
  void* din = dummyIn.get();
  void* dout = inPlace ? din : dummyOut.get();

  // Measured plan from wisdom, if any.
  if (fftwf_plan p = plan(din, dout, base | FFTW_MEASURE | FFTW_WISDOM_ONLY)) return p;

  if (s.measure) {
    std::size_t inBytes = extentOf(k.n, k.howmany, k.istride, k.idist) * sizeof(fftwf_complex);
    std::size_t outBytes = extentOf(k.n, k.howmany, k.ostride, k.odist) * sizeof(fftwf_complex);
    if (inPlace) inBytes = outBytes = std::max(inBytes, outBytes);
    // Very large batches are not worth measuring.
    if (inBytes + outBytes <= kMeasureLimit) {
      FftwBuffer a(fftwf_malloc(inBytes));
      FftwBuffer b(inPlace ? nullptr : fftwf_malloc(outBytes));
      if (a && (inPlace || b)) {
        if (fftwf_plan p = plan(a.get(), inPlace ? a.get() : b.get(), base | FFTW_MEASURE)) {
          if (!s.wisdomPath.empty()) fftwf_export_wisdom_to_filename(s.wisdomPath.c_str());
          return p;
        }
      }
    }
  }
  return plan(din, dout, base | FFTW_ESTIMATE);
}

// Transforms smaller than this run on one thread: the hand-over costs more
// than it gains.
constexpr long long kThreadedWork = 1 << 15;

AxisEntry* axisEntry(const AxisKey& keyIn, bool inPlace, bool aligned) {
  Service& s = service();
  std::lock_guard<std::mutex> lock(s.mutex);
  prepareService(s);
  AxisKey key = keyIn;
  if (key.threads <= 0) {
    key.threads = configuredThreads(s);
    if (static_cast<long long>(key.n) * key.howmany < kThreadedWork) key.threads = 1;
  }
  auto it = s.cache.find(key);
  if (it == s.cache.end()) {
    auto e = std::make_unique<AxisEntry>();
    e->key = key;
    it = s.cache.emplace(key, std::move(e)).first;
  }
  AxisEntry* e = it->second.get();
  std::atomic<fftwf_plan>& p = e->variant[inPlace][aligned];
  if (!p.load()) p.store(createVariant(s, key, inPlace, aligned));
  return p.load() ? e : nullptr;
}

fftwf_plan variantFor(AxisEntry* e, const void* in, void* out) {
  const bool inPlace = in == out;
  const bool aligned =
      fftwf_alignment_of(const_cast<float*>(static_cast<const float*>(in))) == 0 &&
      fftwf_alignment_of(static_cast<float*>(out)) == 0;
  if (ledgerOn.load(std::memory_order_relaxed)) {
    const long long now = monotonicNs();
    if (e->runs[inPlace][aligned].fetch_add(1, std::memory_order_relaxed) == 0)
      e->first[inPlace][aligned].store(now, std::memory_order_relaxed);
    e->last[inPlace][aligned].store(now, std::memory_order_relaxed);
  }
  if (fftwf_plan p = e->variant[inPlace][aligned].load(std::memory_order_acquire)) return p;
  AxisEntry* made = axisEntry(e->key, inPlace, aligned);
  return made ? made->variant[inPlace][aligned].load() : nullptr;
}

bool validDirection(int d) { return d == 0 || d == 1 || d == -1 || d == -2; }

void scaleRect(fcomplex* out, int nx, int ux, int uy, float f) {
  for (int y = 0; y < uy; ++y) {
    float* row = reinterpret_cast<float*>(out + static_cast<std::size_t>(y) * nx);
    for (int i = 0; i < 2 * ux; ++i) row[i] *= f;
  }
}

}  // namespace

int fft_makep_c(FFTPlan& plan, int nx, int ux, int ny, int uy, int rowDirection,
                int colDirection, int inPlace) {
  plan = FFTPlan{};
  if (nx < 1 || ny < 1) return STATUS_BAD_CONDITION;
  if (ux > nx) return 2;
  if (uy > ny) return 3;
  if (ux < 1 || uy < 1 || !validDirection(rowDirection) || !validDirection(colDirection)) return STATUS_BAD_CONDITION;
  plan.nx = nx;
  plan.ux = ux;
  plan.ny = ny;
  plan.uy = uy;
  plan.inPlace = inPlace ? 1 : 0;
  if (rowDirection != 0 && ux != 1) {
    plan.rowNormalise = rowDirection == -1;
    plan.rowDirection = rowDirection > 0 ? 1 : -1;
    AxisKey k{Kind::C2C, ux, uy, 1, nx, 1, nx,
              plan.rowDirection > 0 ? FFTW_FORWARD : FFTW_BACKWARD, 0};
    plan.row = axisEntry(k, plan.inPlace, true);
    if (!plan.row) return STATUS_READ_FAILED;
  }
  if (colDirection != 0 && uy != 1) {
    plan.colNormalise = colDirection == -1;
    plan.colDirection = colDirection > 0 ? 1 : -1;
    AxisKey k{Kind::C2C, uy, ux, nx, 1, nx, 1,
              plan.colDirection > 0 ? FFTW_FORWARD : FFTW_BACKWARD, 0};
    // Columns run in place on the output after a row step.
    plan.col = axisEntry(k, plan.inPlace || plan.row, true);
    if (!plan.col) return STATUS_WRITE_FAILED;
  }
  return 0;
}

int pfft_c(const FFTPlan& plan, const fcomplex* in, fcomplex* out) {
  const fcomplex* src = in;
  if (plan.row) {
    auto* e = static_cast<AxisEntry*>(plan.row);
    fftwf_plan p = variantFor(e, src, out);
    if (!p) return STATUS_READ_FAILED;
    fftwf_execute_dft(p, reinterpret_cast<fftwf_complex*>(const_cast<fcomplex*>(src)),
                      reinterpret_cast<fftwf_complex*>(out));
    src = out;
  }
  if (plan.col) {
    auto* e = static_cast<AxisEntry*>(plan.col);
    fftwf_plan p = variantFor(e, src, out);
    if (!p) return STATUS_WRITE_FAILED;
    fftwf_execute_dft(p, reinterpret_cast<fftwf_complex*>(const_cast<fcomplex*>(src)),
                      reinterpret_cast<fftwf_complex*>(out));
  }
  if (plan.rowNormalise || plan.colNormalise) {
    float f = 1.0f;
    if (plan.rowNormalise) f = 1.0f / static_cast<float>(plan.ux);
    if (plan.colNormalise) f /= static_cast<float>(plan.uy);
    scaleRect(out, plan.nx, plan.ux, plan.uy, f);
  }
  return 0;
}

int fft_destp_c(FFTPlan& plan) {
  // The cache keeps the FFTW plans for the next record of the same shape.
  plan = FFTPlan{};
  return 0;
}

int fft_c(int nx, int ux, int ny, int uy, int rowDirection, int colDirection, const fcomplex* in,
          fcomplex* out) {
  FFTPlan plan;
  int st = fft_makep_c(plan, nx, ux, ny, uy, rowDirection, colDirection, in == out);
  if (st != 0) return st;
  st = pfft_c(plan, in, out);
  fft_destp_c(plan);
  return st;
}

// ---------------------------------------------------------------- real set

int fft_makep_r(FFTPlanR& plan, int nx, int ux, int ny, int uy, int rowDirection,
                int colDirection, int inPlace) {
  plan = FFTPlanR{};
  if (nx < 1 || ny < 1) return STATUS_BAD_CONDITION;
  if (ux > nx) return 2;
  if (uy > ny) return 3;
  if (ux < 1 || uy < 1 || !validDirection(rowDirection) || !validDirection(colDirection)) return STATUS_BAD_CONDITION;
  plan.nx = nx;
  plan.ux = ux;
  plan.ny = ny;
  plan.uy = uy;
  plan.inPlace = inPlace ? 1 : 0;
  const int cx = nx / 2 + 1;  // complex row pitch
  const int cu = ux / 2 + 1;  // used complex samples
  if (rowDirection != 0) {
    plan.rowNormalise = rowDirection == -1;
    plan.rowDirection = rowDirection > 0 ? 1 : -1;
    AxisKey k = plan.rowDirection > 0
                    ? AxisKey{Kind::R2C, ux, uy, 1, nx, 1, cx, FFTW_FORWARD, 0}
                    : AxisKey{Kind::C2R, ux, uy, 1, cx, 1, nx, FFTW_BACKWARD, 0};
    plan.row = axisEntry(k, false, true);
    if (!plan.row) return STATUS_READ_FAILED;
  }
  if (colDirection != 0 && uy != 1) {
    plan.colNormalise = colDirection == -1;
    plan.colDirection = colDirection > 0 ? 1 : -1;
    AxisKey k{Kind::C2C, uy, cu, cx, 1, cx, 1,
              plan.colDirection > 0 ? FFTW_FORWARD : FFTW_BACKWARD, 0};
    plan.col = axisEntry(k, true, true);
    if (!plan.col) return STATUS_WRITE_FAILED;
  }
  return 0;
}

int pfft_r(const FFTPlanR& plan, const void* in, void* out) {
  const int cx = plan.nx / 2 + 1;
  const int cu = plan.ux / 2 + 1;
  const std::size_t complexCount = static_cast<std::size_t>(cx) * plan.uy;
  float f = 1.0f;
  if (plan.rowNormalise) f = 1.0f / static_cast<float>(plan.ux);
  if (plan.colNormalise) f /= static_cast<float>(plan.uy);

  if (plan.rowDirection >= 0) {
    // Forward (or columns only): real rows to half-spectra, columns in place.
    auto* cout = static_cast<fcomplex*>(out);
    if (plan.row) {
      fftwf_plan p = variantFor(static_cast<AxisEntry*>(plan.row), in, out);
      if (!p) return STATUS_READ_FAILED;
      fftwf_execute_dft_r2c(p, const_cast<float*>(static_cast<const float*>(in)),
                            reinterpret_cast<fftwf_complex*>(cout));
    } else if (in != out) {
      std::memcpy(out, in, complexCount * sizeof(fcomplex));
    }
    if (plan.col) {
      fftwf_plan p = variantFor(static_cast<AxisEntry*>(plan.col), cout, cout);
      if (!p) return STATUS_WRITE_FAILED;
      fftwf_execute_dft(p, reinterpret_cast<fftwf_complex*>(cout),
                        reinterpret_cast<fftwf_complex*>(cout));
    }
    if (f != 1.0f) scaleRect(cout, cx, cu, plan.uy, f);
    return 0;
  }
  // Backward: columns on a copy of the half-spectra, then rows to real.
  std::vector<fcomplex> work(static_cast<const fcomplex*>(in),
                             static_cast<const fcomplex*>(in) + complexCount);
  if (plan.col) {
    fftwf_plan p = variantFor(static_cast<AxisEntry*>(plan.col), work.data(), work.data());
    if (!p) return STATUS_WRITE_FAILED;
    fftwf_execute_dft(p, reinterpret_cast<fftwf_complex*>(work.data()),
                      reinterpret_cast<fftwf_complex*>(work.data()));
  }
  auto* rout = static_cast<float*>(out);
  fftwf_plan p = variantFor(static_cast<AxisEntry*>(plan.row), work.data(), out);
  if (!p) return STATUS_READ_FAILED;
  fftwf_execute_dft_c2r(p, reinterpret_cast<fftwf_complex*>(work.data()), rout);
  if (f != 1.0f) {
    for (int y = 0; y < plan.uy; ++y)
      for (int i = 0; i < plan.ux; ++i) rout[static_cast<std::size_t>(y) * plan.nx + i] *= f;
  }
  return 0;
}

int fft_destp_r(FFTPlanR& plan) {
  plan = FFTPlanR{};
  return 0;
}

int fft_r(int nx, int ux, int ny, int uy, int rowDirection, int colDirection, const void* in,
          void* out) {
  FFTPlanR plan;
  int st = fft_makep_r(plan, nx, ux, ny, uy, rowDirection, colDirection, in == out);
  if (st != 0) return st;
  st = pfft_r(plan, in, out);
  fft_destp_r(plan);
  return st;
}

// ------------------------------------------------------------ length rule

int genpow(int n, int step) {
  if (n <= 0) return 0;
  if (step < 1) step = 1;
  for (long long v = n; v <= 0x7fffffffLL; v += step) {
    if (v == 5625) v = 5626;
    long long r = v;
    int e2 = 0, e3 = 0, e5 = 0;
    while (r % 2 == 0) { r /= 2; ++e2; }
    while (r % 3 == 0) { r /= 3; ++e3; }
    while (r % 5 == 0) { r /= 5; ++e5; }
    if (r != 1) continue;
    long long out = 1;
    for (int i = 0; i < e2; ++i) out *= 2;
    for (int i = 0; i < e3; ++i) out *= 3;
    for (int i = 0; i < e5; ++i) out *= 5;
    return static_cast<int>(out);
  }
  return 0;
}

// ----------------------------------------------------------------- shifts

void fftshift(fcomplex* data, int n, int rows) {
  if (n < 2) return;
  const int h = n / 2;
  for (int r = 0; r < rows; ++r) {
    fcomplex* x = data + static_cast<std::size_t>(r) * n;
    if (n % 2 == 0) {
      std::swap_ranges(x, x + h, x + h);
    } else {
      std::rotate(x, x + h + 1, x + n);  // a b c d e -> d e a b c
    }
  }
}

void ifftshift(fcomplex* data, int n, int rows) {
  if (n < 2) return;
  const int h = n / 2;
  for (int r = 0; r < rows; ++r) {
    fcomplex* x = data + static_cast<std::size_t>(r) * n;
    if (n % 2 == 0) {
      std::swap_ranges(x, x + h, x + h);
    } else {
      std::rotate(x, x + h, x + n);  // d e a b c -> a b c d e
    }
  }
}

// ---------------------------------------------------------------- chirp-z

int czt_makep_c(CZTPlan& plan, int M, int K) {
  plan = CZTPlan{};
  if (M < 1 || K < 1) return STATUS_BAD_CONDITION;
  const int L = genpow(M + K - 1, 1);
  int st = fft_makep_c(plan.forward, L, L, 1, 1, FFT_FORWARD, FFT_NONE, 1);
  if (st != 0) return st;
  st = fft_makep_c(plan.backward, L, L, 1, 1, FFT_BACKWARD_NORMALISED, FFT_NONE, 1);
  if (st != 0) return st;
  plan.M = M;
  plan.K = K;
  plan.L = L;
  return 0;
}

int pczt_c(const CZTPlan& plan, const fcomplex* in, fcomplex* out, double a, double b, int rows) {
  const int M = plan.M, K = plan.K, L = plan.L;
  auto ph = [a](long long n) { return static_cast<double>(n) * static_cast<double>(n) * a / 2.0; };

  std::vector<fcomplex> pre(M), post(K), kernel(L, fcomplex(0.0f, 0.0f)), work(L);
  for (int n = 0; n < M; ++n) {
    const double p = ph(n) - n * b;
    pre[n] = fcomplex(static_cast<float>(std::cos(p)), static_cast<float>(std::sin(p)));
  }
  for (int k = 0; k < K; ++k) {
    const double p = ph(k);
    post[k] = fcomplex(static_cast<float>(std::cos(p)), static_cast<float>(std::sin(p)));
  }
  for (int m = 0; m <= M + K - 2; ++m) {
    const double p = -ph(m + 1 - M);
    kernel[m] = fcomplex(static_cast<float>(std::cos(p)), static_cast<float>(std::sin(p)));
  }
  pfft_c(plan.forward, kernel.data(), kernel.data());

  for (int r = 0; r < rows; ++r) {
    const fcomplex* x = in + static_cast<std::size_t>(r) * M;
    fcomplex* y = out + static_cast<std::size_t>(r) * K;
    std::fill(work.begin(), work.end(), fcomplex(0.0f, 0.0f));
    for (int n = 0; n < M; ++n) work[n] = x[n] * pre[n];
    pfft_c(plan.forward, work.data(), work.data());
    for (int i = 0; i < L; ++i) work[i] *= kernel[i];
    pfft_c(plan.backward, work.data(), work.data());
    for (int k = 0; k < K; ++k) y[k] = work[k + M - 1] * post[k];
  }
  return 0;
}

int czt_destp_c(CZTPlan& plan) {
  fft_destp_c(plan.forward);
  fft_destp_c(plan.backward);
  plan = CZTPlan{};
  return 0;
}

int czt_c(const fcomplex* in, int M, fcomplex* out, int K, double a, double b, int rows) {
  CZTPlan plan;
  int st = czt_makep_c(plan, M, K);
  if (st != 0) return st;
  st = pczt_c(plan, in, out, a, b, rows);
  czt_destp_c(plan);
  return st;
}

// ------------------------------------------------------- aligned blocks

void* fft_malloc(std::size_t bytes) {
  constexpr std::size_t kAlign = 64;
  // Blocks of many megabytes (azimuth blocks, range passes) start on a huge
  // page and ask for huge pages: a column pass touches one page per row, so
  // with 4 KiB pages it misses the address translation cache on every row,
  // and a fresh block costs one fault per 4 KiB.
  constexpr std::size_t kHuge = std::size_t(2) << 20;
  if (bytes >= 4 * kHuge) {
    const std::size_t rounded = (bytes + kHuge - 1) / kHuge * kHuge;
    void* p = std::aligned_alloc(kHuge, rounded);
    if (!p) return p;
    madvise(p, rounded, MADV_HUGEPAGE);  // advice only: a refusal changes nothing
    // The threads fault the pages in side by side: the kernel clears every
    // fresh page, which on a virtual machine costs about 3 s per GB.
    const long pages = static_cast<long>(rounded / kHuge);
    volatile char* const first = static_cast<char*>(p);
#pragma omp parallel for schedule(static)
    for (long i = 0; i < pages; ++i) first[static_cast<std::size_t>(i) * kHuge] = 0;
    return p;
  }
  std::size_t rounded = (bytes + kAlign - 1) / kAlign * kAlign;
  if (rounded == 0) rounded = kAlign;
  return std::aligned_alloc(kAlign, rounded);
}

void* fft_calloc(std::size_t count, std::size_t size) {
  if (size != 0 && count > static_cast<std::size_t>(-1) / size) return nullptr;
  void* p = fft_malloc(count * size);
  if (p) std::memset(p, 0, count * size);
  return p;
}

void fft_free(void* p) {
  if (p) std::free(p);
}

// ---------------------------------------------------------------- service

void fft_set_threads(int threads) {
  Service& s = service();
  std::lock_guard<std::mutex> lock(s.mutex);
  s.threads = threads > 0 ? threads : 0;
}

int fft_get_threads() {
  Service& s = service();
  std::lock_guard<std::mutex> lock(s.mutex);
  return configuredThreads(s);
}

bool fft_import_wisdom(const std::string& path) {
  Service& s = service();
  std::lock_guard<std::mutex> lock(s.mutex);
  prepareService(s);
  return fftwf_import_wisdom_from_filename(path.c_str()) != 0;
}

bool fft_export_wisdom(const std::string& path) {
  Service& s = service();
  std::lock_guard<std::mutex> lock(s.mutex);
  return fftwf_export_wisdom_to_filename(path.c_str()) != 0;
}

void fft_set_measure(bool measure) {
  Service& s = service();
  std::lock_guard<std::mutex> lock(s.mutex);
  s.measure = measure;
}

void fft_cleanup() {
  Service& s = service();
  std::lock_guard<std::mutex> lock(s.mutex);
  s.destroyPlans();
}
