#include "product/general_sar_base.h"

#include <climits>

#include "base/status.h"
#include "diag/report.h"

// ---- GeneralSAR_BaseXML -------------------------------------------------------

GeneralSAR_BaseXML::GeneralSAR_BaseXML() = default;
GeneralSAR_BaseXML::~GeneralSAR_BaseXML() = default;

int GeneralSAR_BaseXML::createBuffers() { return 0; }
int GeneralSAR_BaseXML::destroyBuffers() { return 0; }
void GeneralSAR_BaseXML::refreshParameters() {}

int GeneralSAR_BaseXML::createElementsVector(int n) {
  if (n < 0) return STATUS_BAD_CONDITION;
  elements.assign(size_t(n), parElement());
  numberOfElements = n;
  nextElement = 0;
  refreshParameters();
  if (nextElement != 0)
    ORV_REPORT("Element table of " + std::to_string(n) + " rows filled with " +
                   std::to_string(nextElement) + " elements",
               REPORT_WARNING);
  for (auto& e : elements) e.setRegistered(true);
  return 0;
}

int GeneralSAR_BaseXML::destroyElementsVector() {
  elements.clear();
  numberOfElements = 0;
  nextElement = 0;
  return 0;
}

int GeneralSAR_BaseXML::createBuffersDefault() {
  if (isBufferAllocated()) destroyBuffers();
  refreshParameters();
  setAllocationFlag(true);
  return 0;
}

int GeneralSAR_BaseXML::addElement(const std::string& name, void* ptr,
                                   parElement::ParameterType type, int size, double min,
                                   double max, bool mandatory) {
  if (numberOfElements <= 0 || nextElement >= numberOfElements) return STATUS_BAD_CONDITION;
  elements[size_t(nextElement)].setElement(name, ptr, type, size, min, max, mandatory);
  if (++nextElement == numberOfElements) nextElement = 0;
  return 0;
}

int GeneralSAR_BaseXML::addElementInt(const std::string& name, int* ptr, int size, int min,
                                      int max, bool mandatory) {
  return addElement(name, ptr, parElement::PT_INT, size, min, max, mandatory);
}

int GeneralSAR_BaseXML::addElementFloat(const std::string& name, float* ptr, int size, float min,
                                        float max, bool mandatory) {
  return addElement(name, ptr, parElement::PT_FLOAT, size, min, max, mandatory);
}

int GeneralSAR_BaseXML::addElementDouble(const std::string& name, double* ptr, int size,
                                         double min, double max, bool mandatory) {
  return addElement(name, ptr, parElement::PT_DOUBLE, size, min, max, mandatory);
}

int GeneralSAR_BaseXML::addElementString(const std::string& name, std::string* ptr,
                                         bool mandatory) {
  return addElement(name, ptr, parElement::PT_STRING, 1, 0.0, 0.0, mandatory);
}

int GeneralSAR_BaseXML::addElementString(const std::string& name, std::string* ptr, int size,
                                         bool mandatory) {
  return addElement(name, ptr, parElement::PT_STRING, size, 0.0, 0.0, mandatory);
}

int GeneralSAR_BaseXML::setAuxiliaryFile(const std::string& file, int channel,
                                         const std::string& className) {
  auxFile = file;
  auxChannel = channel;
  auxClass = className;
  return xml.initXmlFile(file) == 0 && xml.isOpen() ? 0 : 1;
}

int GeneralSAR_BaseXML::unsetAuxiliaryFile() {
  auxFile.clear();
  xml.clean();
  auxChannel = 0;
  return 0;
}

int GeneralSAR_BaseXML::cleanAuxiliaryFile() {
  if (!xml.isOpen() || auxClass.empty()) return STATUS_BAD_CONDITION;
  if (xml.countNodes(auxChannel, auxClass) > 0) xml.removeNodes(auxChannel, auxClass);
  return 0;
}

int GeneralSAR_BaseXML::readElement(const parElement& e, int size) {
  if (size <= 0) return 0;
  if (e.pointer == nullptr) return STATUS_BAD_CONDITION;
  const std::string path = auxClass + "/" + e.name;
  switch (e.type) {
    case parElement::PT_INT:
      return xml.readInt(auxChannel, path, static_cast<int*>(e.pointer), size);
    case parElement::PT_FLOAT:
      return xml.readFloat(auxChannel, path, static_cast<float*>(e.pointer), size);
    case parElement::PT_DOUBLE:
      return xml.readDouble(auxChannel, path, static_cast<double*>(e.pointer), size);
    case parElement::PT_STRING:
      return xml.readString(auxChannel, path, static_cast<std::string*>(e.pointer), size);
    default:
      return STATUS_BAD_CONDITION;
  }
}

int GeneralSAR_BaseXML::writeElement(const parElement& e) {
  if (e.size <= 0) return 0;
  if (e.pointer == nullptr) return STATUS_BAD_CONDITION;
  const std::string path = auxClass + "/" + e.name;
  switch (e.type) {
    case parElement::PT_INT:
      return xml.writeInt(auxChannel, path, static_cast<const int*>(e.pointer), e.size);
    case parElement::PT_FLOAT:
      return xml.writeFloat(auxChannel, path, static_cast<const float*>(e.pointer), e.size);
    case parElement::PT_DOUBLE:
      return xml.writeDouble(auxChannel, path, static_cast<const double*>(e.pointer), e.size);
    case parElement::PT_STRING:
      return xml.writeString(auxChannel, path, static_cast<const std::string*>(e.pointer),
                             e.size);
    default:
      return STATUS_BAD_CONDITION;
  }
}

int GeneralSAR_BaseXML::readAuxiliaryFile() {
  if (!xml.isOpen()) return STATUS_BAD_CONDITION;
  // 1: scalar numbers first, so that sizes are known before allocation.
  for (const auto& e : elements) {
    if (!e.scalar || e.type == parElement::PT_STRING || e.type == parElement::PT_UNSET) continue;
    if (readElement(e, 1) != 0 && e.mandatory) return STATUS_BAD_CONDITION;
  }
  // 2: allocation from those sizes; the table is re-aimed here.
  if (createBuffers() != 0) return STATUS_BAD_CONDITION;
  if (!allocated) return STATUS_BAD_CONDITION;
  // 3: every persisted element with its present size.
  for (const auto& e : elements) {
    if (e.size <= 0) continue;
    if (readElement(e, e.size) != 0 && e.mandatory) return STATUS_BAD_CONDITION;
  }
  return 0;
}

int GeneralSAR_BaseXML::writeAuxiliaryFile() {
  cleanAuxiliaryFile();
  if (!allocated) return STATUS_BAD_CONDITION;
  if (!xml.isOpen()) return STATUS_BAD_CONDITION;
  for (const auto& e : elements) {
    if (e.size <= 0) continue;
    if (writeElement(e) != 0) return STATUS_BAD_CONDITION;
  }
  return xml.write();
}

bool GeneralSAR_BaseXML::readAuxiliaryFile(const std::string& file, int channel,
                                           const std::string& className) {
  bool ok = setAuxiliaryFile(file, channel, className) == 0 && readAuxiliaryFile() == 0;
  unsetAuxiliaryFile();
  return ok;
}

int GeneralSAR_BaseXML::writeAuxiliaryFile(const std::string& file, int channel,
                                          const std::string& className) {
  int rc = setAuxiliaryFile(file, channel, className);
  if (rc == 0) rc = writeAuxiliaryFile();
  unsetAuxiliaryFile();
  return rc;
}

bool GeneralSAR_BaseXML::checkAuxiliaryFile() { return true; }

bool GeneralSAR_BaseXML::checkAuxiliaryFile(const std::string&, int, const std::string&) {
  return true;
}

bool GeneralSAR_BaseXML::getConfigurationFile(const std::string& file, int channel,
                                              const std::string& className, std::string& out) {
  bool ok = setAuxiliaryFile(file, channel, className) == 0 &&
            xml.readString(channel, className + "/ConfigurationFile", &out, 1) == 0;
  unsetAuxiliaryFile();
  return ok;
}

// ---- GeneralSAR_Base ----------------------------------------------------------

int GeneralSAR_Base::writehdr() { return 0; }
int GeneralSAR_Base::writehdr(const std::string&) { return 0; }
int GeneralSAR_Base::readhdr(const std::string&) { return 0; }

// ---- GeneralSAR_BaseConfiguration -----------------------------------------------

int GeneralSAR_BaseConfiguration::readConf(const std::string& file, int channel,
                                           const std::string& group) {
  orvanexml doc(file);
  if (!doc.isRecognised()) return STATUS_BAD_CONDITION;
  doc.readInt(channel, group + "/Memory", &Memory, 1);
  doc.readInt(channel, group + "/Incore", &Incore, 1);
  doc.readInt(channel, group + "/Verbose", &Verbose, 1);
  doc.readInt(channel, group + "/ReportLevel", &ReportLevel, 1);
  doc.readString(channel, group + "/ReportFilename", &ReportFilename, 1);
  return 0;
}

int GeneralSAR_BaseConfiguration::writeConf(const std::string& file, int channel,
                                            const std::string& group) {
  orvanexml doc(file);
  if (!doc.isOpen()) return STATUS_BAD_CONDITION;
  int rc = 0;
  rc |= doc.writeInt(channel, group + "/Memory", &Memory, 1);
  rc |= doc.writeInt(channel, group + "/Incore", &Incore, 1);
  rc |= doc.writeInt(channel, group + "/Verbose", &Verbose, 1);
  rc |= doc.writeInt(channel, group + "/ReportLevel", &ReportLevel, 1);
  rc |= doc.writeString(channel, group + "/ReportFilename", &ReportFilename, 1);
  if (rc != 0) return STATUS_BAD_CONDITION;
  return doc.write();
}

void GeneralSAR_BaseConfiguration::cloneConf(GeneralSAR_BaseConfiguration& target) const {
  target.Memory = Memory;
  target.Incore = Incore;
  target.Verbose = Verbose;
  target.ReportLevel = ReportLevel;
  target.ReportFilename = ReportFilename;
}

// ---- processing tools -------------------------------------------------------------

int ProcessingTool::readpar(const std::string& file, int channel) {
  readAuxiliaryFile(file, channel, className_);
  return 0;
}

int ProcessingTool::writepar(const std::string& file, int channel) {
  return writeAuxiliaryFile(file, channel, className_);
}

int ProcessingTool::FinalizeProcessing(const std::string&, int) {
  exit_report();
  return 0;
}

bool ProcessingTool::namesOtherConfiguration(const std::string& file, int channel) {
  std::string target = ReportFilename;
  if (!getConfigurationFile(file, channel, className_, target)) return false;
  ReportFilename = target;
  return true;
}

void ProcessingTool::addCommonElements() {
  addElementInt("Memory", &Memory, 1, 0, INT_MAX, true);
  addElementString("ReportFilename", &ReportFilename, true);
  addElementInt("ReportLevel", &ReportLevel, 1, 0, 3, true);
  addElementInt("Incore", &Incore, 1, 0, 1, true);
  addElementInt("Verbose", &Verbose, 1, 0, 1, true);
}
