#pragma once
// Fixed-offset fields of CEOS records. A sensor describes each record it
// reads or writes as a table of CeosField values (offsets from the record's
// first byte); the extractor reads through CeosRecord, the simulator's
// writers write the same fields, so both always agree on the layout.
#include <cstdint>
#include <string>
#include <vector>

// One field: offset from the first byte of its record and width in bytes.
struct CeosField {
  int offset;
  int width;
  // The field of element `index` of a group repeated every `stride` bytes.
  constexpr CeosField element(int index, int stride) const {
    return {offset + index * stride, width};
  }
  // The `width` characters of this field starting `skip` characters in.
  constexpr CeosField part(int skip, int partWidth) const { return {offset + skip, partWidth}; }
  constexpr int end() const { return offset + width; }
};

// Offset in the file of a field of the record starting at `recordStart`.
constexpr long fileOffset(long recordStart, CeosField field) { return recordStart + field.offset; }

// Record head shared by every CEOS record: sequence number, four type bytes,
// record length (big-endian binary).
namespace ceos_head {
inline constexpr CeosField kSequence{0, 4};
inline constexpr CeosField kType{4, 4};
inline constexpr CeosField kLength{8, 4};
}  // namespace ceos_head

// Head of every file descriptor record: format, software, file name and
// the locators of the record sequence number, type code and length.
namespace ceos_descriptor {
inline constexpr CeosField kAsciiFlag{12, 4};
inline constexpr CeosField kFormatDocument{16, 12};
inline constexpr CeosField kFormatRevision{28, 4};
inline constexpr CeosField kSoftwareVersion{32, 12};
inline constexpr CeosField kFileNumber{44, 4};
inline constexpr CeosField kFileName{48, 16};
inline constexpr CeosField kSequenceFlag{64, 4};
inline constexpr CeosField kSequenceLocation{68, 8};
inline constexpr CeosField kSequenceWidth{76, 4};
inline constexpr CeosField kCodeFlag{80, 4};
inline constexpr CeosField kCodeLocation{84, 8};
inline constexpr CeosField kCodeWidth{92, 4};
inline constexpr CeosField kLengthFlag{96, 4};
inline constexpr CeosField kLengthLocation{100, 8};
inline constexpr CeosField kLengthWidth{108, 4};
}  // namespace ceos_descriptor

// Read access to the fields of one record of a file image held in memory.
// Reading a field outside the bytes is the caller's mistake: test with has()
// first, as a short file must be reported, not read.
class CeosRecord {
 public:
  CeosRecord(const std::vector<char>& bytes, long recordStart)
      : bytes_(bytes), start_(recordStart) {}

  bool has(CeosField field) const {
    const long first = start_ + field.offset;
    return first >= 0 && first + field.width <= static_cast<long>(bytes_.size());
  }
  const char* at(CeosField field) const { return bytes_.data() + start_ + field.offset; }
  // The field as text, cut at its first NUL.
  std::string text(CeosField field) const;
  // Decimal with a point (see FtoDouble).
  double real(CeosField field) const;
  // Mantissa and exponent (see FtoDouble2).
  double realExp(CeosField field) const;
  // Right-aligned decimal integer (see ch2int).
  int integer(CeosField field) const;

 private:
  const std::vector<char>& bytes_;
  long start_;
};

// Big-endian binary fields of a record held as bytes.
std::uint32_t ceosBE32(const unsigned char* record, CeosField field);
int ceosBE16(const unsigned char* record, CeosField field);
