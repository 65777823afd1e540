#pragma once
// Numeric vectors and matrices indexed from explicit lower to upper bounds
// (usually 1-based), as the fitting and solving kernels expect them.
#include <cstddef>
#include <stdexcept>
#include <vector>

// A vector indexed from nl to nh inclusive.
template <class T>
class NrVector {
 public:
  NrVector() = default;
  NrVector(long nl, long nh) { resize(nl, nh); }
  NrVector(long nl, long nh, const T& value) { resize(nl, nh, value); }

  void resize(long nl, long nh, const T& value = T()) {
    if (nh < nl - 1) throw std::length_error("NrVector: upper bound below lower bound");
    nl_ = nl;
    nh_ = nh;
    data_.assign(static_cast<std::size_t>(nh - nl + 1), value);
  }
  void fill(const T& value) { data_.assign(data_.size(), value); }

  T& operator[](long i) { return data_[static_cast<std::size_t>(i - nl_)]; }
  const T& operator[](long i) const { return data_[static_cast<std::size_t>(i - nl_)]; }

  long lo() const { return nl_; }
  long hi() const { return nh_; }
  std::size_t size() const { return data_.size(); }
  // Element nl, i.e. a 0-based view of the storage.
  T* data() { return data_.data(); }
  const T* data() const { return data_.data(); }

 private:
  long nl_ = 1;
  long nh_ = 0;
  std::vector<T> data_;
};

// A matrix indexed m[i][j] with nrl <= i <= nrh, ncl <= j <= nch, stored as
// one row-major block.
template <class T>
class NrMatrix {
 public:
  class Row {
   public:
    Row(T* p, long ncl) : p_(p), ncl_(ncl) {}
    T& operator[](long j) const { return p_[j - ncl_]; }
   private:
    T* p_;
    long ncl_;
  };
  class ConstRow {
   public:
    ConstRow(const T* p, long ncl) : p_(p), ncl_(ncl) {}
    const T& operator[](long j) const { return p_[j - ncl_]; }
   private:
    const T* p_;
    long ncl_;
  };

  NrMatrix() = default;
  NrMatrix(long nrl, long nrh, long ncl, long nch) { resize(nrl, nrh, ncl, nch); }

  void resize(long nrl, long nrh, long ncl, long nch, const T& value = T()) {
    if (nrh < nrl - 1 || nch < ncl - 1)
      throw std::length_error("NrMatrix: upper bound below lower bound");
    nrl_ = nrl;
    nrh_ = nrh;
    ncl_ = ncl;
    nch_ = nch;
    data_.assign(static_cast<std::size_t>((nrh - nrl + 1) * (nch - ncl + 1)), value);
  }
  void fill(const T& value) { data_.assign(data_.size(), value); }

  Row operator[](long i) { return Row(data_.data() + (i - nrl_) * cols(), ncl_); }
  ConstRow operator[](long i) const { return ConstRow(data_.data() + (i - nrl_) * cols(), ncl_); }

  long rowLo() const { return nrl_; }
  long rowHi() const { return nrh_; }
  long colLo() const { return ncl_; }
  long colHi() const { return nch_; }
  long rows() const { return nrh_ - nrl_ + 1; }
  long cols() const { return nch_ - ncl_ + 1; }
  // Row-major storage, element (nrl, ncl) first.
  T* data() { return data_.data(); }
  const T* data() const { return data_.data(); }

 private:
  long nrl_ = 1, nrh_ = 0, ncl_ = 1, nch_ = 0;
  std::vector<T> data_;
};

// A three-index block t[i][j][k].
template <class T>
class NrTensor3 {
 public:
  NrTensor3() = default;
  NrTensor3(long nrl, long nrh, long ncl, long nch, long ndl, long ndh)
      : nrl_(nrl), ncl_(ncl), ndl_(ndl), nc_(nch - ncl + 1), nd_(ndh - ndl + 1) {
    if (nrh < nrl - 1 || nch < ncl - 1 || ndh < ndl - 1)
      throw std::length_error("NrTensor3: upper bound below lower bound");
    data_.assign(static_cast<std::size_t>((nrh - nrl + 1) * nc_ * nd_), T());
  }
  T& operator()(long i, long j, long k) {
    return data_[static_cast<std::size_t>(((i - nrl_) * nc_ + (j - ncl_)) * nd_ + (k - ndl_))];
  }
  const T& operator()(long i, long j, long k) const {
    return data_[static_cast<std::size_t>(((i - nrl_) * nc_ + (j - ncl_)) * nd_ + (k - ndl_))];
  }
  T* data() { return data_.data(); }

 private:
  long nrl_ = 1, ncl_ = 1, ndl_ = 1, nc_ = 0, nd_ = 0;
  std::vector<T> data_;
};

// Allocators by element type. They throw std::bad_alloc when memory is out;
// the kernels catch it and return status 7.
inline NrVector<double> dvector(long nl, long nh) { return NrVector<double>(nl, nh); }
inline NrVector<long double> ldvector(long nl, long nh) { return NrVector<long double>(nl, nh); }
inline NrVector<float> fvector(long nl, long nh) { return NrVector<float>(nl, nh); }
inline NrVector<int> ivector(long nl, long nh) { return NrVector<int>(nl, nh); }
inline NrVector<long> lvector(long nl, long nh) { return NrVector<long>(nl, nh); }
inline NrVector<unsigned char> cvector(long nl, long nh) { return NrVector<unsigned char>(nl, nh); }
inline NrMatrix<double> dmatrix(long nrl, long nrh, long ncl, long nch) {
  return NrMatrix<double>(nrl, nrh, ncl, nch);
}
inline NrMatrix<long double> ldmatrix(long nrl, long nrh, long ncl, long nch) {
  return NrMatrix<long double>(nrl, nrh, ncl, nch);
}
inline NrMatrix<float> fmatrix(long nrl, long nrh, long ncl, long nch) {
  return NrMatrix<float>(nrl, nrh, ncl, nch);
}
inline NrMatrix<int> imatrix(long nrl, long nrh, long ncl, long nch) {
  return NrMatrix<int>(nrl, nrh, ncl, nch);
}
inline NrMatrix<unsigned char> cmatrix(long nrl, long nrh, long ncl, long nch) {
  return NrMatrix<unsigned char>(nrl, nrh, ncl, nch);
}
inline NrTensor3<float> f3tensor(long nrl, long nrh, long ncl, long nch, long ndl, long ndh) {
  return NrTensor3<float>(nrl, nrh, ncl, nch, ndl, ndh);
}

// Copy of rows oldrl.. and columns oldcl.. of a, re-indexed from (newrl, newcl).
template <class T>
NrMatrix<T> submatrix(const NrMatrix<T>& a, long oldrl, long oldrh, long oldcl, long oldch,
                      long newrl, long newcl) {
  NrMatrix<T> s(newrl, newrl + oldrh - oldrl, newcl, newcl + oldch - oldcl);
  for (long i = oldrl; i <= oldrh; ++i)
    for (long j = oldcl; j <= oldch; ++j) s[newrl + i - oldrl][newcl + j - oldcl] = a[i][j];
  return s;
}

// A row-major block of nr x nc values (0-based) as a matrix with the given bounds.
template <class T>
NrMatrix<T> convert_matrix(const T* a, long nrl, long nrh, long ncl, long nch) {
  NrMatrix<T> m(nrl, nrh, ncl, nch);
  const long nc = nch - ncl + 1;
  for (long i = nrl; i <= nrh; ++i)
    for (long j = ncl; j <= nch; ++j) m[i][j] = a[(i - nrl) * nc + (j - ncl)];
  return m;
}
