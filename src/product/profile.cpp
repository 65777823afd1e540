// Profile files: process-wide cache of INI-like parameter files.
//
// The cache holds files, each file its sections, each section its keys, all in
// file order (oldest first). A look-up walks from the newest end, so of
// several sections or keys of one name the one that stood last is found
// first, and new sections and keys are added at the newest end, which is
// also the end that is printed last.
#include "product/profile.h"

#include <algorithm>
#include <cinttypes>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <iterator>
#include <list>
#include <new>

#include "diag/report.h"

namespace {

struct ProfileKey {
  std::string key;
  std::string value;
};

struct ProfileSection {
  std::string name;
  std::list<ProfileKey> keys;  // file order
};

struct ProfileFile {
  std::string path;
  std::list<ProfileSection> sections;  // file order
};

// Cache in order of creation (oldest first); the current file is the one
// last found or created by a look-up.
std::list<ProfileFile>& cache() {
  static std::list<ProfileFile> files;
  return files;
}
ProfileFile* g_current = nullptr;

constexpr int kOk = 0;
constexpr int kFail = 10;

std::string trimBlanks(const std::string& s) {
  size_t b = s.find_first_not_of(' ');
  if (b == std::string::npos) return std::string();
  size_t e = s.find_last_not_of(' ');
  return s.substr(b, e - b + 1);
}

// Six-state reader of the file text. Only the blank is trimmed; there is no
// comment syntax; a newline does not end a key; '[' is seen wherever a key
// may stand but never inside a value; a value ends at the newline only.
void parseProfile(std::FILE* fp, ProfileFile& pf) {
  std::string buf;
  buf.reserve(4096);
  int state = 0;
  ProfileSection* section = nullptr;
  ProfileKey* key = nullptr;
  char chunk[65536];
  size_t got;
  while ((got = std::fread(chunk, 1, sizeof chunk, fp)) > 0) {
    for (size_t i = 0; i < got; ++i) {
      const char ch = chunk[i];
      switch (state) {
        case 0:
          if (ch == '[') {
            buf.clear();
            state = 1;
          }
          break;
        case 1:
          if (ch == ']') {
            pf.sections.push_back(ProfileSection{trimBlanks(buf), {}});
            section = &pf.sections.back();
            buf.clear();
            state = 2;
          } else {
            buf.push_back(ch);
          }
          break;
        case 2:
          if (ch == '\n') {
            buf.clear();
            state = 3;
          }
          break;
        case 3:
          if (ch == '[') {
            buf.clear();
            state = 1;
          } else if (ch == ' ') {
          } else if (ch == '=') {
            state = 2;
          } else {
            buf.push_back(ch);
            state = 4;
          }
          break;
        case 4:
          if (ch == '[') {
            buf.clear();
            state = 1;
          } else if (ch == '=') {
            section->keys.push_back(ProfileKey{trimBlanks(buf), {}});
            key = &section->keys.back();
            buf.clear();
            state = 5;
          } else {
            buf.push_back(ch);
          }
          break;
        case 5:
          if (ch == '\n') {
            key->value = trimBlanks(buf);
            buf.clear();
            state = 3;
          } else {
            buf.push_back(ch);
          }
          break;
      }
    }
  }
  if (state == 5) key->value = trimBlanks(buf);
}

ProfileFile* findFile(const std::string& path) {
  for (auto& f : cache())
    if (f.path == path) return &f;
  return nullptr;
}

// Finds the file in the cache or loads it. A file that cannot be opened or is
// empty gives a node without sections.
ProfileFile& loadFile(const std::string& path) {
  ProfileFile* pf = findFile(path);
  if (pf == nullptr) {
    cache().push_back(ProfileFile{path, {}});
    pf = &cache().back();
    if (std::FILE* fp = std::fopen(path.c_str(), "rb")) {
      try {
        parseProfile(fp, *pf);
      } catch (const std::bad_alloc&) {
        std::fclose(fp);
        cache().pop_back();
        throw ProfileMemoryError("Memory re-allocation failure\n");
      }
      std::fclose(fp);
    }
  }
  g_current = pf;
  return *pf;
}

// "\n[name]\n" for each section, "key = value\n" for each key, in file
// order. Strings are written whole (a NUL read from a file goes back out).
void writeProfile(std::FILE* fp, const ProfileFile& pf) {
  auto put = [fp](const std::string& s) { std::fwrite(s.data(), 1, s.size(), fp); };
  for (const auto& s : pf.sections) {
    put("\n[");
    put(s.name);
    put("]\n");
    for (const auto& k : s.keys) {
      put(k.key);
      put(" = ");
      put(k.value);
      put("\n");
    }
  }
}

// 0 written, 1 not opened, -1 close failed.
int syncOne(const ProfileFile& pf) {
  std::FILE* fp = std::fopen(pf.path.c_str(), "wb");
  if (fp == nullptr) return 1;
  writeProfile(fp, pf);
  bool bad = std::ferror(fp) != 0;
  if (std::fclose(fp) != 0 || bad) return -1;
  return 0;
}

std::string fmt(const char* format, ...) __attribute__((format(printf, 1, 2)));
std::string fmt(const char* format, ...) {
  char small[256];
  va_list ap;
  va_start(ap, format);
  va_list ap2;
  va_copy(ap2, ap);
  int n = std::vsnprintf(small, sizeof small, format, ap);
  va_end(ap);
  std::string out;
  if (n < 0) {
    va_end(ap2);
    return out;
  }
  if (size_t(n) < sizeof small) {
    out.assign(small, size_t(n));
  } else {
    out.resize(size_t(n) + 1);
    std::vsnprintf(out.data(), out.size(), format, ap2);
    out.resize(size_t(n));
  }
  va_end(ap2);
  return out;
}

// Reports are made in the name of the public call that failed.
void reportShort(const char* who, int got, int n, const std::string& section,
                 const std::string& key, const std::string& file) {
  orv_add_report(fmt("Read only %d elements of %d - SEC: %s, KEY: %s, FILE: %s", got, n,
                     section.c_str(), key.c_str(), file.c_str()),
                 REPORT_WARNING, __LINE__, who, __FILE__);
}

int store(const char* who, const std::string& section, const std::string& key,
          const std::string& value, const std::string& file) {
  if (GetSetProfileChar(1, section, key, value, file) == nullptr) {
    orv_add_report(fmt("Parameter writing failed - SEC: %s, KEY: %s, FILE: %s", section.c_str(),
                       key.c_str(), file.c_str()),
                   REPORT_WARNING, __LINE__, who, __FILE__);
    return kFail;
  }
  return kOk;
}

// ---- number formats ---------------------------------------------------------

void formatItem(std::string& out, int v) { out += fmt("%d ", v); }
void formatItem(std::string& out, long v) { out += fmt("%ld ", v); }
void formatItem(std::string& out, long long v) { out += fmt("%lld ", v); }
void formatItem(std::string& out, float v) { out += fmt("%.*g ", 7, double(v)); }
void formatItem(std::string& out, double v) { out += fmt("%.*g ", 15, v); }

void stripTrailingBlanks(std::string& s) {
  while (!s.empty() && s.back() == ' ') s.pop_back();
}

template <typename T>
std::string formatRow(const T* src, int n, int stride) {
  std::string out = "{";
  for (int i = 0; i < n; ++i) formatItem(out, src[size_t(i) * size_t(stride)]);
  stripTrailingBlanks(out);
  out += '}';
  return out;
}

std::string quoteRow(const std::string* src, int n, int stride) {
  std::string out = "{";
  for (int i = 0; i < n; ++i) {
    out += '"';
    out += src[size_t(i) * size_t(stride)];
    out += "\" ";
  }
  stripTrailingBlanks(out);
  out += '}';
  return out;
}

bool convert(const char* tok, int& v) { return std::sscanf(tok, "%d", &v) == 1; }
bool convert(const char* tok, long& v) { return std::sscanf(tok, "%ld", &v) == 1; }
bool convert(const char* tok, long long& v) { return std::sscanf(tok, "%lld", &v) == 1; }
bool convert(const char* tok, float& v) { return std::sscanf(tok, "%f", &v) == 1; }
bool convert(const char* tok, double& v) { return std::sscanf(tok, "%lf", &v) == 1; }

// Tokenised read of up to n numbers: one leading '{' skipped, tokens split on
// blanks and tabs, the first token that does not convert ends the reading.
template <typename T, typename U>
int readNumbers(const char* who, const std::string& section, const std::string& key, U* dst, int n,
                const std::string& file) {
  const std::string* value = GetSetProfileChar(0, section, key, std::string(), file);
  if (value == nullptr) return kFail;
  std::string text = *value;
  size_t pos = (!text.empty() && text[0] == '{') ? 1 : 0;
  int got = 0;
  while (got < n) {
    size_t b = text.find_first_not_of(" \t", pos);
    if (b == std::string::npos) break;
    size_t e = text.find_first_of(" \t", b);
    if (e == std::string::npos) e = text.size();
    std::string tok = text.substr(b, e - b);
    T v{};
    if (!convert(tok.c_str(), v)) break;
    dst[got++] = static_cast<U>(v);
    pos = e;
  }
  if (got < n) {
    reportShort(who, got, n, section, key, file);
    return kFail;
  }
  return kOk;
}

template <typename V>
V* grown(std::vector<V>& v, int n) {
  if (n > 0 && v.size() < size_t(n)) v.resize(size_t(n));
  return v.data();
}

int stringArray(const char* who, const std::string& section, const std::string& key,
                std::string* dst, int n, const std::string& file) {
  const std::string* value = GetSetProfileChar(0, section, key, std::string(), file);
  if (value == nullptr) return kFail;
  const std::string text = *value;
  if (text.empty() || text[0] != '{') return kOk;
  int count = 0;
  bool inside = false;
  size_t start = 0;
  size_t pos = 1;
  while (count < n && pos < text.size()) {
    const char ch = text[pos];
    if (!inside) {
      if (ch == '"') {
        inside = true;
        start = pos + 1;
      } else if (ch == '}') {
        return count;
      } else if (ch != ' ') {
        return kOk;
      }
    } else if (ch == '"') {
      dst[count++] = text.substr(start, pos - start);
      inside = false;
    }
    ++pos;
  }
  if (inside) return kFail;
  if (count >= n) return kOk;
  reportShort(who, count, n, section, key, file);
  return kFail;
}

[[noreturn]] void checkFailed(const std::string& message) { throw ProfileCheckError(message); }

}  // namespace

// ---- core -----------------------------------------------------------------

const std::string* GetSetProfileChar(int mode, const std::string& section, const std::string& key,
                                     const std::string& value, const std::string& file) {
  ProfileFile& pf = loadFile(file);
  // Newest first; a read goes on through further sections of the same name,
  // a write lands in the newest section of the name.
  for (auto s = pf.sections.rbegin(); s != pf.sections.rend(); ++s) {
    if (s->name != section) continue;
    for (auto k = s->keys.rbegin(); k != s->keys.rend(); ++k) {
      if (k->key == key) {
        if (mode == 1) k->value = value;
        return &k->value;
      }
    }
    if (mode == 1) {
      s->keys.push_back(ProfileKey{key, value});
      return &s->keys.back().value;
    }
  }
  if (mode != 1) return nullptr;
  ProfileFile& target = g_current != nullptr ? *g_current : pf;
  target.sections.push_back(ProfileSection{section, {}});
  target.sections.back().keys.push_back(ProfileKey{key, value});
  return &target.sections.back().keys.back().value;
}

// ---- strings ----------------------------------------------------------------

int GetMyProfileString(const std::string& section, const std::string& key, std::string& dst,
                       const std::string& file) {
  const std::string* value = GetSetProfileChar(0, section, key, std::string(), file);
  if (value == nullptr) return kFail;
  dst = *value;
  return kOk;
}

int GetMyProfileString(const std::string& section, const std::string& key, char* dst, int size,
                       const std::string& file) {
  const std::string* value = GetSetProfileChar(0, section, key, std::string(), file);
  if (value == nullptr) return kFail;
  if (dst != nullptr && size > 0) {
    size_t n = std::min(value->size(), size_t(size - 1));
    std::memcpy(dst, value->data(), n);
    dst[n] = '\0';
  }
  return kOk;
}

int WriteMyProfileString(const std::string& section, const std::string& key,
                         const std::string& value, const std::string& file) {
  return store(__func__, section, key, value, file);
}

int WriteMyProfileStringQuote(const std::string& section, const std::string& key,
                              const std::string& value, const std::string& file) {
  return store(__func__, section, key, "\"" + value + "\"", file);
}

int GetMyProfileStringArray(const std::string& section, const std::string& key,
                            std::vector<std::string>& dst, int n, int /*len*/,
                            const std::string& file) {
  return stringArray(__func__, section, key, grown(dst, n), n, file);
}

int GetMyProfileStringArray(const std::string& section, const std::string& key, std::string* dst,
                            int n, int /*len*/, const std::string& file) {
  return stringArray(__func__, section, key, dst, n, file);
}

int WriteMyProfileStringArray(const std::string& section, const std::string& key,
                              const std::string* src, int n, const std::string& file) {
  return store(__func__, section, key, quoteRow(src, n, 1), file);
}

int WriteMyProfileStringArray(const std::string& section, const std::string& key,
                              const std::vector<std::string>& src, const std::string& file) {
  return WriteMyProfileStringArray(section, key, src.data(), int(src.size()), file);
}

int WriteMyProfileStringMatrix(const std::string& section, const std::string& key,
                               const std::string* src, int rows, int cols,
                               const std::string& file) {
  std::string text;
  for (int r = 0; r < rows; ++r) {
    if (r > 0) text += "\n\t";
    text += quoteRow(src + r, cols, rows);
  }
  return store(__func__, section, key, text, file);
}

// ---- number arrays ------------------------------------------------------------

int GetMyProfileIntArray(const std::string& section, const std::string& key, int* dst, int n,
                         const std::string& file) {
  return readNumbers<int>(__func__, section, key, dst, n, file);
}
int GetMyProfileIntArray(const std::string& section, const std::string& key, std::vector<int>& dst,
                         int n, const std::string& file) {
  return readNumbers<int>(__func__, section, key, grown(dst, n), n, file);
}
int GetMyProfileInt64Array(const std::string& section, const std::string& key, int64_t* dst, int n,
                           const std::string& file) {
  return readNumbers<long long>(__func__, section, key, dst, n, file);
}
int GetMyProfileInt64Array(const std::string& section, const std::string& key,
                           std::vector<int64_t>& dst, int n, const std::string& file) {
  return readNumbers<long long>(__func__, section, key, grown(dst, n), n, file);
}
int GetMyProfileLongArray(const std::string& section, const std::string& key, long* dst, int n,
                          const std::string& file) {
  return readNumbers<long>(__func__, section, key, dst, n, file);
}
int GetMyProfileLongArray(const std::string& section, const std::string& key,
                          std::vector<long>& dst, int n, const std::string& file) {
  return readNumbers<long>(__func__, section, key, grown(dst, n), n, file);
}
int GetMyProfileFloatArray(const std::string& section, const std::string& key, float* dst, int n,
                           const std::string& file) {
  return readNumbers<float>(__func__, section, key, dst, n, file);
}
int GetMyProfileFloatArray(const std::string& section, const std::string& key,
                           std::vector<float>& dst, int n, const std::string& file) {
  return readNumbers<float>(__func__, section, key, grown(dst, n), n, file);
}
int GetProfileDoubleArray(const std::string& section, const std::string& key, double* dst, int n,
                          const std::string& file) {
  return readNumbers<double>(__func__, section, key, dst, n, file);
}
int GetProfileDoubleArray(const std::string& section, const std::string& key,
                          std::vector<double>& dst, int n, const std::string& file) {
  return readNumbers<double>(__func__, section, key, grown(dst, n), n, file);
}
int GetMyProfileDoubleArray(const std::string& section, const std::string& key, double* dst, int n,
                            const std::string& file) {
  return GetProfileDoubleArray(section, key, dst, n, file);
}
int GetMyProfileDoubleArray(const std::string& section, const std::string& key,
                            std::vector<double>& dst, int n, const std::string& file) {
  return GetProfileDoubleArray(section, key, dst, n, file);
}

int WriteMyProfileIntArray(const std::string& section, const std::string& key, const int* src,
                           int n, const std::string& file) {
  return store(__func__, section, key, formatRow(src, n, 1), file);
}
int WriteMyProfileIntArray(const std::string& section, const std::string& key,
                           const std::vector<int>& src, const std::string& file) {
  return WriteMyProfileIntArray(section, key, src.data(), int(src.size()), file);
}
int WriteMyProfileInt64Array(const std::string& section, const std::string& key,
                             const int64_t* src, int n, const std::string& file) {
  std::vector<long long> tmp(src, src + (n > 0 ? n : 0));
  return store(__func__, section, key, formatRow(tmp.data(), n, 1), file);
}
int WriteMyProfileInt64Array(const std::string& section, const std::string& key,
                             const std::vector<int64_t>& src, const std::string& file) {
  return WriteMyProfileInt64Array(section, key, src.data(), int(src.size()), file);
}
int WriteMyProfileLongArray(const std::string& section, const std::string& key, const long* src,
                            int n, const std::string& file) {
  return store(__func__, section, key, formatRow(src, n, 1), file);
}
int WriteMyProfileLongArray(const std::string& section, const std::string& key,
                            const std::vector<long>& src, const std::string& file) {
  return WriteMyProfileLongArray(section, key, src.data(), int(src.size()), file);
}
int WriteMyProfileFloatArray(const std::string& section, const std::string& key, const float* src,
                             int n, const std::string& file) {
  return store(__func__, section, key, formatRow(src, n, 1), file);
}
int WriteMyProfileFloatArray(const std::string& section, const std::string& key,
                             const std::vector<float>& src, const std::string& file) {
  return WriteMyProfileFloatArray(section, key, src.data(), int(src.size()), file);
}
int WriteProfileDoubleArray(const std::string& section, const std::string& key, const double* src,
                            int n, const std::string& file) {
  return store(__func__, section, key, formatRow(src, n, 1), file);
}
int WriteProfileDoubleArray(const std::string& section, const std::string& key,
                            const std::vector<double>& src, const std::string& file) {
  return WriteProfileDoubleArray(section, key, src.data(), int(src.size()), file);
}
int WriteMyProfileDoubleArray(const std::string& section, const std::string& key,
                              const double* src, int n, const std::string& file) {
  return WriteProfileDoubleArray(section, key, src, n, file);
}
int WriteMyProfileDoubleArray(const std::string& section, const std::string& key,
                              const std::vector<double>& src, const std::string& file) {
  return WriteProfileDoubleArray(section, key, src, file);
}

int WriteMyProfileDoubleMatrix(const std::string& section, const std::string& key,
                               const double* src, int rows, int cols, const std::string& file) {
  std::string text;
  for (int r = 0; r < rows; ++r) {
    if (r > 0) text += "\n\t";
    text += formatRow(src + r, cols, rows);
  }
  return store(__func__, section, key, text, file);
}

// ---- single numbers -------------------------------------------------------------

int WriteMyProfileInt(const std::string& section, const std::string& key, int value,
                      const std::string& file) {
  std::string text;
  formatItem(text, value);
  stripTrailingBlanks(text);
  return store(__func__, section, key, text, file);
}
int WriteMyProfileInt64(const std::string& section, const std::string& key, int64_t value,
                        const std::string& file) {
  std::string text;
  formatItem(text, static_cast<long long>(value));
  stripTrailingBlanks(text);
  return store(__func__, section, key, text, file);
}
int WriteMyProfileDouble(const std::string& section, const std::string& key, double value,
                         const std::string& file) {
  std::string text;
  formatItem(text, value);
  stripTrailingBlanks(text);
  return store(__func__, section, key, text, file);
}

// ---- checked twins ------------------------------------------------------------------

namespace {
std::string plainMessage(const char* name, const std::string& section, const std::string& key,
                         const std::string& file) {
  return fmt("Error in %s: section %s, key %s, file %s\n", name, section.c_str(), key.c_str(),
             file.c_str());
}
}  // namespace

#define PROFILE_CHECK(call, message) \
  do {                               \
    if ((call) != 0) checkFailed(message); \
    return 0;                        \
  } while (0)

int GetCheckMyProfileString(const std::string& section, const std::string& key, std::string& dst,
                            const std::string& file) {
  PROFILE_CHECK(GetMyProfileString(section, key, dst, file),
                plainMessage("GetMyProfileString", section, key, file));
}
int GetCheckMyProfileString(const std::string& section, const std::string& key, char* dst,
                            int size, const std::string& file) {
  PROFILE_CHECK(GetMyProfileString(section, key, dst, size, file),
                plainMessage("GetMyProfileString", section, key, file));
}
int WriteCheckMyProfileString(const std::string& section, const std::string& key,
                              const std::string& value, const std::string& file) {
  PROFILE_CHECK(WriteMyProfileString(section, key, value, file),
                fmt("Error in WriteMyProfileString: section %s, key %s, string %s, file %s\n",
                    section.c_str(), key.c_str(), value.c_str(), file.c_str()));
}
int GetCheckMyProfileStringArray(const std::string& section, const std::string& key,
                                 std::vector<std::string>& dst, int n, int len,
                                 const std::string& file) {
  PROFILE_CHECK(GetMyProfileStringArray(section, key, dst, n, len, file),
                plainMessage("GetMyProfileStringArray", section, key, file));
}
int GetCheckMyProfileStringArray(const std::string& section, const std::string& key,
                                 std::string* dst, int n, int len, const std::string& file) {
  PROFILE_CHECK(GetMyProfileStringArray(section, key, dst, n, len, file),
                plainMessage("GetMyProfileStringArray", section, key, file));
}
int WriteCheckMyProfileStringArray(const std::string& section, const std::string& key,
                                   const std::string* src, int n, const std::string& file) {
  PROFILE_CHECK(WriteMyProfileStringArray(section, key, src, n, file),
                plainMessage("WriteMyProfileStringArray", section, key, file));
}
int WriteCheckMyProfileStringArray(const std::string& section, const std::string& key,
                                   const std::vector<std::string>& src, const std::string& file) {
  PROFILE_CHECK(WriteMyProfileStringArray(section, key, src, file),
                plainMessage("WriteMyProfileStringArray", section, key, file));
}

int GetCheckMyProfileIntArray(const std::string& section, const std::string& key, int* dst, int n,
                              const std::string& file) {
  PROFILE_CHECK(GetMyProfileIntArray(section, key, dst, n, file),
                plainMessage("GetMyProfileIntArray", section, key, file));
}
int GetCheckMyProfileIntArray(const std::string& section, const std::string& key,
                              std::vector<int>& dst, int n, const std::string& file) {
  PROFILE_CHECK(GetMyProfileIntArray(section, key, dst, n, file),
                plainMessage("GetMyProfileIntArray", section, key, file));
}
int GetCheckMyProfileInt64Array(const std::string& section, const std::string& key, int64_t* dst,
                                int n, const std::string& file) {
  PROFILE_CHECK(GetMyProfileInt64Array(section, key, dst, n, file),
                plainMessage("GetMyProfileInt64Array", section, key, file));
}
int GetCheckMyProfileInt64Array(const std::string& section, const std::string& key,
                                std::vector<int64_t>& dst, int n, const std::string& file) {
  PROFILE_CHECK(GetMyProfileInt64Array(section, key, dst, n, file),
                plainMessage("GetMyProfileInt64Array", section, key, file));
}
// The long reader reports under the int reader's name.
int GetCheckMyProfileLongArray(const std::string& section, const std::string& key, long* dst,
                               int n, const std::string& file) {
  PROFILE_CHECK(GetMyProfileLongArray(section, key, dst, n, file),
                plainMessage("GetMyProfileIntArray", section, key, file));
}
int GetCheckMyProfileLongArray(const std::string& section, const std::string& key,
                               std::vector<long>& dst, int n, const std::string& file) {
  PROFILE_CHECK(GetMyProfileLongArray(section, key, dst, n, file),
                plainMessage("GetMyProfileIntArray", section, key, file));
}
int GetCheckMyProfileFloatArray(const std::string& section, const std::string& key, float* dst,
                                int n, const std::string& file) {
  PROFILE_CHECK(GetMyProfileFloatArray(section, key, dst, n, file),
                plainMessage("GetMyProfileFloatArray", section, key, file));
}
int GetCheckMyProfileFloatArray(const std::string& section, const std::string& key,
                                std::vector<float>& dst, int n, const std::string& file) {
  PROFILE_CHECK(GetMyProfileFloatArray(section, key, dst, n, file),
                plainMessage("GetMyProfileFloatArray", section, key, file));
}
// The double reader and the float and double array writers report under the
// name of the double writer.
int GetCheckMyProfileDoubleArray(const std::string& section, const std::string& key, double* dst,
                                 int n, const std::string& file) {
  PROFILE_CHECK(GetProfileDoubleArray(section, key, dst, n, file),
                plainMessage("WriteMyProfileDouble", section, key, file));
}
int GetCheckMyProfileDoubleArray(const std::string& section, const std::string& key,
                                 std::vector<double>& dst, int n, const std::string& file) {
  PROFILE_CHECK(GetProfileDoubleArray(section, key, dst, n, file),
                plainMessage("WriteMyProfileDouble", section, key, file));
}

int WriteCheckMyProfileIntArray(const std::string& section, const std::string& key,
                                const int* src, int n, const std::string& file) {
  PROFILE_CHECK(WriteMyProfileIntArray(section, key, src, n, file),
                plainMessage("WriteMyProfileIntArray", section, key, file));
}
int WriteCheckMyProfileIntArray(const std::string& section, const std::string& key,
                                const std::vector<int>& src, const std::string& file) {
  PROFILE_CHECK(WriteMyProfileIntArray(section, key, src, file),
                plainMessage("WriteMyProfileIntArray", section, key, file));
}
int WriteCheckMyProfileInt64Array(const std::string& section, const std::string& key,
                                  const int64_t* src, int n, const std::string& file) {
  PROFILE_CHECK(WriteMyProfileInt64Array(section, key, src, n, file),
                plainMessage("WriteMyProfileInt64Array", section, key, file));
}
int WriteCheckMyProfileInt64Array(const std::string& section, const std::string& key,
                                  const std::vector<int64_t>& src, const std::string& file) {
  PROFILE_CHECK(WriteMyProfileInt64Array(section, key, src, file),
                plainMessage("WriteMyProfileInt64Array", section, key, file));
}
int WriteCheckMyProfileLongArray(const std::string& section, const std::string& key,
                                 const long* src, int n, const std::string& file) {
  PROFILE_CHECK(WriteMyProfileLongArray(section, key, src, n, file),
                plainMessage("WriteMyProfileLongArray", section, key, file));
}
int WriteCheckMyProfileLongArray(const std::string& section, const std::string& key,
                                 const std::vector<long>& src, const std::string& file) {
  PROFILE_CHECK(WriteMyProfileLongArray(section, key, src, file),
                plainMessage("WriteMyProfileLongArray", section, key, file));
}
int WriteCheckMyProfileFloatArray(const std::string& section, const std::string& key,
                                  const float* src, int n, const std::string& file) {
  PROFILE_CHECK(WriteMyProfileFloatArray(section, key, src, n, file),
                plainMessage("WriteMyProfileDouble", section, key, file));
}
int WriteCheckMyProfileFloatArray(const std::string& section, const std::string& key,
                                  const std::vector<float>& src, const std::string& file) {
  PROFILE_CHECK(WriteMyProfileFloatArray(section, key, src, file),
                plainMessage("WriteMyProfileDouble", section, key, file));
}
int WriteCheckMyProfileDoubleArray(const std::string& section, const std::string& key,
                                   const double* src, int n, const std::string& file) {
  PROFILE_CHECK(WriteProfileDoubleArray(section, key, src, n, file),
                plainMessage("WriteMyProfileDouble", section, key, file));
}
int WriteCheckMyProfileDoubleArray(const std::string& section, const std::string& key,
                                   const std::vector<double>& src, const std::string& file) {
  PROFILE_CHECK(WriteProfileDoubleArray(section, key, src, file),
                plainMessage("WriteMyProfileDouble", section, key, file));
}

int WriteCheckMyProfileInt(const std::string& section, const std::string& key, int value,
                           const std::string& file) {
  PROFILE_CHECK(WriteMyProfileInt(section, key, value, file),
                fmt("Error in WriteMyProfileInt: section %s, key %s, value %d, file %s\n",
                    section.c_str(), key.c_str(), value, file.c_str()));
}
// The 64-bit message prints the value as a real.
int WriteCheckMyProfileInt64(const std::string& section, const std::string& key, int64_t value,
                             const std::string& file) {
  PROFILE_CHECK(WriteMyProfileInt64(section, key, value, file),
                fmt("Error in WriteMyProfileInt64: section %s, key %s, value %f, file %s\n",
                    section.c_str(), key.c_str(), double(value), file.c_str()));
}
int WriteCheckMyProfileDouble(const std::string& section, const std::string& key, double value,
                              const std::string& file) {
  PROFILE_CHECK(WriteMyProfileDouble(section, key, value, file),
                fmt("Error in WriteMyProfileDouble: section %s, key %s, value %f, file %s\n",
                    section.c_str(), key.c_str(), value, file.c_str()));
}

#undef PROFILE_CHECK

// ---- cache maintenance ----------------------------------------------------------------

int SyncProfile(const char* file) {
  if (file != nullptr) return SyncProfile(std::string(file));
  // Oldest first; only the result of the newest file counts, inverted.
  int last = 0;
  for (const auto& f : cache()) last = syncOne(f);
  return last == 0 ? -1 : 0;
}

int SyncProfile(const std::string& file) {
  const ProfileFile* pf = findFile(file);
  if (pf == nullptr) return 0;
  return syncOne(*pf);
}

void FreeProfile(const char* file) {
  if (file != nullptr) {
    FreeProfile(std::string(file));
    return;
  }
  cache().clear();
  g_current = nullptr;
}

void FreeProfile(const std::string& file) {
  auto& files = cache();
  for (auto it = files.begin(); it != files.end(); ++it) {
    if (it->path == file) {
      if (g_current == &*it) g_current = nullptr;
      files.erase(it);
      return;
    }
  }
}

int DelProfileKey(const std::string& section, const std::string& key, const std::string& file) {
  ProfileFile* pf = findFile(file);
  if (pf == nullptr) {
    std::fputs("Warning: DelProfileKey called before init\n", stderr);
    return kFail;
  }
  for (auto s = pf->sections.rbegin(); s != pf->sections.rend(); ++s) {
    if (s->name != section) continue;
    for (auto k = s->keys.rbegin(); k != s->keys.rend(); ++k) {
      if (k->key == key) {
        s->keys.erase(std::next(k).base());
        return kOk;
      }
    }
    return kFail;
  }
  return kFail;
}

int DelProfileSection(const std::string& section, const std::string& file) {
  ProfileFile* pf = findFile(file);
  if (pf == nullptr) {
    std::fputs("Warning: DelProfileSection called before init\n", stderr);
    return kFail;
  }
  for (auto s = pf->sections.rbegin(); s != pf->sections.rend(); ++s) {
    if (s->name == section) {
      pf->sections.erase(std::next(s).base());
      return kOk;
    }
  }
  return kFail;
}
