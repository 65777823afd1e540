#include "sim/sim_fft.h"

#include <cmath>
#include <stdexcept>
#include <utility>

#include "base/constants.h"

bool isPowerOfTwo(int n) { return n > 0 && (n & (n - 1)) == 0; }

int nextPowerOfTwo(int n) {
  int p = 1;
  while (p < n) p <<= 1;
  return p;
}

void simFft(cdouble* a, int n, int sign) {
  if (!isPowerOfTwo(n)) throw std::invalid_argument("FFT length " + std::to_string(n) + " is not a power of two");
  for (int i = 1, j = 0; i < n; ++i) {
    int bit = n >> 1;
    for (; j & bit; bit >>= 1) j ^= bit;
    j ^= bit;
    if (i < j) std::swap(a[i], a[j]);
  }
  for (int len = 2; len <= n; len <<= 1) {
    const double ang = sign * 2.0 * consts::kPi / len;
    const int half = len / 2;
    for (int k = 0; k < half; ++k) {
      const cdouble w(std::cos(ang * k), std::sin(ang * k));
      for (int i = k; i < n; i += len) {
        const cdouble u = a[i], v = a[i + half] * w;
        a[i] = u + v;
        a[i + half] = u - v;
      }
    }
  }
}

void simFft2(std::vector<cdouble>& d, int rows, int cols, int sign) {
  for (int r = 0; r < rows; ++r) simFft(d.data() + static_cast<std::size_t>(r) * cols, cols, sign);
  std::vector<cdouble> col(rows);
  for (int c = 0; c < cols; ++c) {
    for (int r = 0; r < rows; ++r) col[r] = d[static_cast<std::size_t>(r) * cols + c];
    simFft(col.data(), rows, sign);
    for (int r = 0; r < rows; ++r) d[static_cast<std::size_t>(r) * cols + c] = col[r];
  }
}
