#pragma once
// Profile files: INI-like text files of named sections holding "key = value"
// lines. Every touched file is kept as a tree in a process-wide cache; reads
// and writes act on that tree and nothing reaches the disk before
// SyncProfile. Values are text; the typed calls format and parse numbers,
// arrays and matrices.
//
// Unless told otherwise every call returns 0 on success and 10 on failure.
// Arguments run section, key, value(s), file. Paths, sections and keys are
// compared byte for byte.
//
// Array readers come in two forms: a raw pointer with n items, and a vector
// that is grown to n items if it is shorter. Array writers take a pointer and
// n, or a whole vector.
#include <cstdint>
#include <stdexcept>
#include <string>
#include <vector>

// A profile file that cannot be held in memory. The message is the text the
// program prints on the error stream before it ends with status 1; the job
// driver does both.
class ProfileMemoryError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

// A checked call (GetCheck..., WriteCheck...) that failed. The message is the
// "Error in ..." text the program prints on the error stream before it ends
// with status 1; the job driver does both.
class ProfileCheckError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

// ---- core ----------------------------------------------------------------

// mode 0 reads, mode 1 writes `value`. Returns the stored value (owned by the
// cache, valid until the next change of that key or FreeProfile) or null when
// a read finds no key.
const std::string* GetSetProfileChar(int mode, const std::string& section, const std::string& key,
                                     const std::string& value, const std::string& file);

// ---- strings ---------------------------------------------------------------

// Copies the value into dst; 10 without a report if the key is absent.
int GetMyProfileString(const std::string& section, const std::string& key, std::string& dst,
                       const std::string& file);
// Buffer form: copies at most size - 1 characters and terminates.
int GetMyProfileString(const std::string& section, const std::string& key, char* dst, int size,
                       const std::string& file);
int WriteMyProfileString(const std::string& section, const std::string& key,
                         const std::string& value, const std::string& file);
// Stores "value" with the double quotes.
int WriteMyProfileStringQuote(const std::string& section, const std::string& key,
                              const std::string& value, const std::string& file);

// Reads {"a" "b" ...}. Returns 0 when n strings were read, or when the value
// does not start with '{'; the count read so far when a '}' ends the list
// early; 10 (with a report) when the text ends before n strings or a string
// is left open. `len` is accepted and not used. dst is grown to n items; items
// not read keep their content.
int GetMyProfileStringArray(const std::string& section, const std::string& key,
                            std::vector<std::string>& dst, int n, int len, const std::string& file);
int GetMyProfileStringArray(const std::string& section, const std::string& key, std::string* dst,
                            int n, int len, const std::string& file);
int WriteMyProfileStringArray(const std::string& section, const std::string& key,
                              const std::string* src, int n, const std::string& file);
int WriteMyProfileStringArray(const std::string& section, const std::string& key,
                              const std::vector<std::string>& src, const std::string& file);
// Column-major: element (r, c) at index r + c * rows; one {...} group per row,
// rows after the first on a new line led by a tab.
int WriteMyProfileStringMatrix(const std::string& section, const std::string& key,
                               const std::string* src, int rows, int cols, const std::string& file);

// ---- number arrays ---------------------------------------------------------
// A plain value and a braced one read alike, so a single number is read with
// n = 1. Fewer than n numbers: report "Read only %d elements of %d - ..." and
// 10, the numbers read stay in dst.

int GetMyProfileIntArray(const std::string& section, const std::string& key, int* dst, int n,
                         const std::string& file);
int GetMyProfileIntArray(const std::string& section, const std::string& key, std::vector<int>& dst,
                         int n, const std::string& file);
int GetMyProfileInt64Array(const std::string& section, const std::string& key, int64_t* dst, int n,
                           const std::string& file);
int GetMyProfileInt64Array(const std::string& section, const std::string& key,
                           std::vector<int64_t>& dst, int n, const std::string& file);
int GetMyProfileLongArray(const std::string& section, const std::string& key, long* dst, int n,
                          const std::string& file);
int GetMyProfileLongArray(const std::string& section, const std::string& key,
                          std::vector<long>& dst, int n, const std::string& file);
int GetMyProfileFloatArray(const std::string& section, const std::string& key, float* dst, int n,
                           const std::string& file);
int GetMyProfileFloatArray(const std::string& section, const std::string& key,
                           std::vector<float>& dst, int n, const std::string& file);
int GetProfileDoubleArray(const std::string& section, const std::string& key, double* dst, int n,
                          const std::string& file);
int GetProfileDoubleArray(const std::string& section, const std::string& key,
                          std::vector<double>& dst, int n, const std::string& file);
// Same as GetProfileDoubleArray (name in line with the other readers).
int GetMyProfileDoubleArray(const std::string& section, const std::string& key, double* dst, int n,
                            const std::string& file);
int GetMyProfileDoubleArray(const std::string& section, const std::string& key,
                            std::vector<double>& dst, int n, const std::string& file);

int WriteMyProfileIntArray(const std::string& section, const std::string& key, const int* src,
                           int n, const std::string& file);
int WriteMyProfileIntArray(const std::string& section, const std::string& key,
                           const std::vector<int>& src, const std::string& file);
int WriteMyProfileInt64Array(const std::string& section, const std::string& key,
                             const int64_t* src, int n, const std::string& file);
int WriteMyProfileInt64Array(const std::string& section, const std::string& key,
                             const std::vector<int64_t>& src, const std::string& file);
int WriteMyProfileLongArray(const std::string& section, const std::string& key, const long* src,
                            int n, const std::string& file);
int WriteMyProfileLongArray(const std::string& section, const std::string& key,
                            const std::vector<long>& src, const std::string& file);
// Floats with 7 significant digits.
int WriteMyProfileFloatArray(const std::string& section, const std::string& key, const float* src,
                             int n, const std::string& file);
int WriteMyProfileFloatArray(const std::string& section, const std::string& key,
                             const std::vector<float>& src, const std::string& file);
// Doubles with 15 significant digits.
int WriteProfileDoubleArray(const std::string& section, const std::string& key, const double* src,
                            int n, const std::string& file);
int WriteProfileDoubleArray(const std::string& section, const std::string& key,
                            const std::vector<double>& src, const std::string& file);
// Same as WriteProfileDoubleArray.
int WriteMyProfileDoubleArray(const std::string& section, const std::string& key,
                              const double* src, int n, const std::string& file);
int WriteMyProfileDoubleArray(const std::string& section, const std::string& key,
                              const std::vector<double>& src, const std::string& file);
// Column-major, as WriteMyProfileStringMatrix.
int WriteMyProfileDoubleMatrix(const std::string& section, const std::string& key,
                               const double* src, int rows, int cols, const std::string& file);

// ---- single numbers (no braces) ---------------------------------------------
int WriteMyProfileInt(const std::string& section, const std::string& key, int value,
                      const std::string& file);
int WriteMyProfileInt64(const std::string& section, const std::string& key, int64_t value,
                        const std::string& file);
int WriteMyProfileDouble(const std::string& section, const std::string& key, double value,
                         const std::string& file);

// ---- checked twins -----------------------------------------------------------
// Same arguments; on failure they throw ProfileCheckError with the
// "Error in ..." text. On success they return 0.

int GetCheckMyProfileString(const std::string& section, const std::string& key, std::string& dst,
                            const std::string& file);
int GetCheckMyProfileString(const std::string& section, const std::string& key, char* dst,
                            int size, const std::string& file);
int WriteCheckMyProfileString(const std::string& section, const std::string& key,
                              const std::string& value, const std::string& file);
int GetCheckMyProfileStringArray(const std::string& section, const std::string& key,
                                 std::vector<std::string>& dst, int n, int len,
                                 const std::string& file);
int GetCheckMyProfileStringArray(const std::string& section, const std::string& key,
                                 std::string* dst, int n, int len, const std::string& file);
int WriteCheckMyProfileStringArray(const std::string& section, const std::string& key,
                                   const std::string* src, int n, const std::string& file);
int WriteCheckMyProfileStringArray(const std::string& section, const std::string& key,
                                   const std::vector<std::string>& src, const std::string& file);

int GetCheckMyProfileIntArray(const std::string& section, const std::string& key, int* dst, int n,
                              const std::string& file);
int GetCheckMyProfileIntArray(const std::string& section, const std::string& key,
                              std::vector<int>& dst, int n, const std::string& file);
int GetCheckMyProfileInt64Array(const std::string& section, const std::string& key, int64_t* dst,
                                int n, const std::string& file);
int GetCheckMyProfileInt64Array(const std::string& section, const std::string& key,
                                std::vector<int64_t>& dst, int n, const std::string& file);
int GetCheckMyProfileLongArray(const std::string& section, const std::string& key, long* dst,
                               int n, const std::string& file);
int GetCheckMyProfileLongArray(const std::string& section, const std::string& key,
                               std::vector<long>& dst, int n, const std::string& file);
int GetCheckMyProfileFloatArray(const std::string& section, const std::string& key, float* dst,
                                int n, const std::string& file);
int GetCheckMyProfileFloatArray(const std::string& section, const std::string& key,
                                std::vector<float>& dst, int n, const std::string& file);
int GetCheckMyProfileDoubleArray(const std::string& section, const std::string& key, double* dst,
                                 int n, const std::string& file);
int GetCheckMyProfileDoubleArray(const std::string& section, const std::string& key,
                                 std::vector<double>& dst, int n, const std::string& file);

int WriteCheckMyProfileIntArray(const std::string& section, const std::string& key,
                                const int* src, int n, const std::string& file);
int WriteCheckMyProfileIntArray(const std::string& section, const std::string& key,
                                const std::vector<int>& src, const std::string& file);
int WriteCheckMyProfileInt64Array(const std::string& section, const std::string& key,
                                  const int64_t* src, int n, const std::string& file);
int WriteCheckMyProfileInt64Array(const std::string& section, const std::string& key,
                                  const std::vector<int64_t>& src, const std::string& file);
int WriteCheckMyProfileLongArray(const std::string& section, const std::string& key,
                                 const long* src, int n, const std::string& file);
int WriteCheckMyProfileLongArray(const std::string& section, const std::string& key,
                                 const std::vector<long>& src, const std::string& file);
int WriteCheckMyProfileFloatArray(const std::string& section, const std::string& key,
                                  const float* src, int n, const std::string& file);
int WriteCheckMyProfileFloatArray(const std::string& section, const std::string& key,
                                  const std::vector<float>& src, const std::string& file);
int WriteCheckMyProfileDoubleArray(const std::string& section, const std::string& key,
                                   const double* src, int n, const std::string& file);
int WriteCheckMyProfileDoubleArray(const std::string& section, const std::string& key,
                                   const std::vector<double>& src, const std::string& file);

int WriteCheckMyProfileInt(const std::string& section, const std::string& key, int value,
                           const std::string& file);
int WriteCheckMyProfileInt64(const std::string& section, const std::string& key, int64_t value,
                             const std::string& file);
int WriteCheckMyProfileDouble(const std::string& section, const std::string& key, double value,
                              const std::string& file);

// ---- cache maintenance ---------------------------------------------------------

// With a path: rewrites that cached file; 0 if written or not cached, 1 if it
// could not be opened for writing, -1 if closing failed.
// With null: rewrites every cached file, oldest first; returns -1 when all
// went well and 0 when the newest file failed (inverted sense kept).
int SyncProfile(const char* file = nullptr);
int SyncProfile(const std::string& file);

// Drops one file (or, with null, all) from the cache without writing.
void FreeProfile(const char* file = nullptr);
void FreeProfile(const std::string& file);

// Remove a key from / the newest section of that name. They do not load the
// file: on a file not in the cache they warn on stderr and do nothing.
// Return 0 if something was removed, 10 otherwise.
int DelProfileKey(const std::string& section, const std::string& key, const std::string& file);
int DelProfileSection(const std::string& section, const std::string& file);
