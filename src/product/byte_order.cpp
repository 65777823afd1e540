#include "product/byte_order.h"

#include <algorithm>
#include <bit>
#include <cstring>

namespace {

// Reads n bytes in the given order into an unsigned integer.
template <typename U>
U readOrdered(const void* bytes, int order) {
  const auto* p = static_cast<const unsigned char*>(bytes);
  U value = 0;
  if (order == kMsbFirst) {
    for (std::size_t i = 0; i < sizeof(U); ++i) value = static_cast<U>((value << 8) | p[i]);
  } else {
    for (std::size_t i = sizeof(U); i-- > 0;) value = static_cast<U>((value << 8) | p[i]);
  }
  return value;
}

template <typename U>
void writeOrdered(U value, void* bytes, int order) {
  auto* p = static_cast<unsigned char*>(bytes);
  for (std::size_t i = 0; i < sizeof(U); ++i) {
    const auto byte = static_cast<unsigned char>(value >> (8 * i));
    if (order == kMsbFirst)
      p[sizeof(U) - 1 - i] = byte;
    else
      p[i] = byte;
  }
}

}  // namespace

int get_endian() { return std::endian::native == std::endian::big ? kMsbFirst : kLsbFirst; }

unsigned short ch2uint2(const void* bytes, int order) {
  return readOrdered<std::uint16_t>(bytes, order);
}
unsigned int ch2uint4(const void* bytes, int order) {
  return readOrdered<std::uint32_t>(bytes, order);
}
short ch2int2(const void* bytes, int order) {
  return static_cast<short>(readOrdered<std::uint16_t>(bytes, order));
}
int ch2int4(const void* bytes, int order) {
  return static_cast<int>(readOrdered<std::uint32_t>(bytes, order));
}
float ch2float4(const void* bytes, int order) {
  return std::bit_cast<float>(readOrdered<std::uint32_t>(bytes, order));
}
double ch2double8(const void* bytes, int order) {
  return std::bit_cast<double>(readOrdered<std::uint64_t>(bytes, order));
}
std::int32_t ch2long4(const void* bytes, int order) {
  return static_cast<std::int32_t>(readOrdered<std::uint32_t>(bytes, order));
}
std::uint32_t ch2ulong4(const void* bytes, int order) {
  return readOrdered<std::uint32_t>(bytes, order);
}

void float2ch(float value, void* bytes, int order) {
  writeOrdered(std::bit_cast<std::uint32_t>(value), bytes, order);
}
void long2ch(std::int32_t value, void* bytes, int order) {
  writeOrdered(static_cast<std::uint32_t>(value), bytes, order);
}
void ulong2ch(std::uint32_t value, void* bytes, int order) { writeOrdered(value, bytes, order); }
void short2ch(short value, void* bytes, int order) {
  writeOrdered(static_cast<std::uint16_t>(value), bytes, order);
}
void ushort2ch(unsigned short value, void* bytes, int order) {
  writeOrdered(static_cast<std::uint16_t>(value), bytes, order);
}

void swp_any(void* value, int nbytes) {
  if (value == nullptr || nbytes < 2) return;
  auto* p = static_cast<unsigned char*>(value);
  std::reverse(p, p + nbytes);
}
void swp2(void* value) { swp_any(value, 2); }
void swp4(void* value) { swp_any(value, 4); }
void swp8(void* value) { swp_any(value, 8); }
void bsw2b(void* value) { swp_any(value, 2); }

bool myisnan(double value) {
  const auto bits = std::bit_cast<std::uint64_t>(value);
  return (bits & 0x7FF0000000000000ULL) == 0x7FF0000000000000ULL &&
         (bits & 0x000FFFFFFFFFFFFFULL) != 0;
}
bool myisinf(double value) {
  return (std::bit_cast<std::uint64_t>(value) & 0x7FFFFFFFFFFFFFFFULL) == 0x7FF0000000000000ULL;
}
bool myfinite(double value) {
  return (std::bit_cast<std::uint64_t>(value) & 0x7FF0000000000000ULL) != 0x7FF0000000000000ULL;
}
bool myisnan4(float value) {
  const auto bits = std::bit_cast<std::uint32_t>(value);
  return (bits & 0x7F800000U) == 0x7F800000U && (bits & 0x007FFFFFU) != 0;
}
bool myisinf4(float value) {
  return (std::bit_cast<std::uint32_t>(value) & 0x7FFFFFFFU) == 0x7F800000U;
}
bool myfinite4(float value) {
  return (std::bit_cast<std::uint32_t>(value) & 0x7F800000U) != 0x7F800000U;
}
