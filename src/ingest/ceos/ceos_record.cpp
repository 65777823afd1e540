#include "ingest/ceos/ceos_record.h"

#include "ingest/ceos/ceos_fields.h"

std::string CeosRecord::text(CeosField field) const { return ceosText(at(field), field.width); }

double CeosRecord::real(CeosField field) const { return FtoDouble(at(field), field.width); }

double CeosRecord::realExp(CeosField field) const { return FtoDouble2(at(field), field.width); }

int CeosRecord::integer(CeosField field) const { return ch2int(at(field), field.width); }

std::uint32_t ceosBE32(const unsigned char* record, CeosField field) {
  const unsigned char* p = record + field.offset;
  return (std::uint32_t(p[0]) << 24) | (std::uint32_t(p[1]) << 16) | (std::uint32_t(p[2]) << 8) |
         std::uint32_t(p[3]);
}

int ceosBE16(const unsigned char* record, CeosField field) {
  const unsigned char* p = record + field.offset;
  return (int(p[0]) << 8) | int(p[1]);
}
