#pragma once
#include <cstdint>

// Byte-order helpers for sensor files. The order code is the character 'm'
// (109) for most significant byte first; any other code reads the bytes least
// significant first. Pointers may be unaligned.

inline constexpr int kMsbFirst = 'm';
inline constexpr int kLsbFirst = 'l';

// Byte order of this machine: 'm' or 'l'.
int get_endian();

unsigned short ch2uint2(const void* bytes, int order);
unsigned int ch2uint4(const void* bytes, int order);
short ch2int2(const void* bytes, int order);
int ch2int4(const void* bytes, int order);
float ch2float4(const void* bytes, int order);
double ch2double8(const void* bytes, int order);
// "long" values of the sensor formats are 32 bits wide.
std::int32_t ch2long4(const void* bytes, int order);
std::uint32_t ch2ulong4(const void* bytes, int order);

// Writers: store the value into bytes in the given order.
void float2ch(float value, void* bytes, int order);
void long2ch(std::int32_t value, void* bytes, int order);
void ulong2ch(std::uint32_t value, void* bytes, int order);
void short2ch(short value, void* bytes, int order);
void ushort2ch(unsigned short value, void* bytes, int order);

// In-place swaps.
void swp2(void* value);
void swp4(void* value);
void swp8(void* value);
void swp_any(void* value, int nbytes);
// Swaps the two bytes of a 16-bit word.
void bsw2b(void* value);

// Tests by bit pattern, independent of the compiler's floating-point mode.
bool myisnan(double value);
bool myisinf(double value);
bool myfinite(double value);
bool myisnan4(float value);
bool myisinf4(float value);
bool myfinite4(float value);
