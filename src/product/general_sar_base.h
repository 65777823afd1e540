#pragma once
// Roots of the parameter hierarchy. A class lists its parameters once, in
// refreshParameters(), with addElementInt/Float/Double/String; the table then
// carries them to and from an XML parameter document (one block per channel
// and class name) without further code.
//
// Tool-class pattern (ATPalExtractor, ATERSExtractor, ATRangeFocuser, ...):
//
//   class ATExample : public GeneralSAR_Base {
//    public:
//     ATExample() { createElementsVector(3); }          // exact element count
//     int createBuffers() override {                    // re-aims the table
//       if (isBufferAllocated()) destroyBuffers();
//       refreshParameters();
//       setAllocationFlag(true);
//       return 0;
//     }
//     int destroyBuffers() override { setAllocationFlag(false); return 0; }
//     void refreshParameters() override {               // order = write order
//       addElementInt("Memory", &Memory, 1, 0, 2147483647, true);
//       addElementString("ReportFilename", &ReportFilename, true);
//       addElementDouble("Coeffs", coeffs.data(), int(coeffs.size()), 0, 1, false);
//       setAllocationFlag(true);
//     }
//     int readpar(const std::string& file, int channel) {
//       readAuxiliaryFile(file, channel, "ATExample");
//       return 0;                                       // keeps defaults on failure
//     }
//     int writepar(const std::string& file, int channel) {
//       return writeAuxiliaryFile(file, channel, "ATExample");
//     }
//     int checkpar() { checkAuxiliaryFile(); return 0; }
//     ...
//   };
//
// createBuffersDefault() performs the createBuffers() body above.
#include <string>
#include <vector>

#include "product/orvane_xml.h"
#include "product/par_element.h"

class GeneralSAR_BaseXML {
 public:
  GeneralSAR_BaseXML();
  // Allocates what the parameter values need; the default does nothing.
  virtual int createBuffers();
  // Frees them; the default does nothing.
  virtual int destroyBuffers();
  virtual ~GeneralSAR_BaseXML();
  // (Re)registers every element; the default does nothing.
  virtual void refreshParameters();

  GeneralSAR_BaseXML(const GeneralSAR_BaseXML&) = delete;
  GeneralSAR_BaseXML& operator=(const GeneralSAR_BaseXML&) = delete;

  // Keeps file, channel and class name, opens the document (a file that is not
  // a parameter document is replaced by a new empty one in memory). 0 / 1.
  int setAuxiliaryFile(const std::string& file, int channel, const std::string& className);
  // Clears the path, frees the document, channel back to 0.
  int unsetAuxiliaryFile();
  // Removes this class's block from the channel.
  int cleanAuxiliaryFile();
  // Three-stage read of the open document: scalars, createBuffers(), then
  // every element with size > 0. 0 on success, 1 on failure.
  int readAuxiliaryFile();
  // Replaces this class's block with the present values and saves. 0 / 1.
  int writeAuxiliaryFile();
  // Set, read, unset. true on success.
  bool readAuxiliaryFile(const std::string& file, int channel, const std::string& className);
  // Set, write, unset. 0 / 1.
  int writeAuxiliaryFile(const std::string& file, int channel, const std::string& className);
  // Both just return true.
  bool checkAuxiliaryFile();
  bool checkAuxiliaryFile(const std::string& file, int channel, const std::string& className);
  // Reads the string <className>/ConfigurationFile into out; true if read.
  bool getConfigurationFile(const std::string& file, int channel, const std::string& className,
                            std::string& out);
  bool isBufferAllocated() const { return allocated; }

  // Inspection (tests, exporters).
  int getNumberOfElements() const { return int(elements.size()); }
  const parElement& getElement(int i) const { return elements.at(size_t(i)); }
  const std::string& getAuxiliaryFileName() const { return auxFile; }
  int getAuxiliaryChannel() const { return auxChannel; }
  const std::string& getAuxiliaryClassName() const { return auxClass; }
  void setXmlDebug(bool on) { xml.setDebug(on); }

 protected:
  // Allocates n rows, runs refreshParameters() once and marks every row
  // registered. 0 on success.
  int createElementsVector(int n);
  int destroyElementsVector();
  void setAllocationFlag(bool value) { allocated = value; }
  // The createBuffers() body of the tool pattern: destroyBuffers() if
  // allocated, refreshParameters(), set the flag, 0.
  int createBuffersDefault();

  // Each call fills the next row; after the last row the index returns to 0,
  // so a later refreshParameters() overwrites the same rows in order. 1 (and
  // nothing changed) when the table has no rows.
  int addElementInt(const std::string& name, int* ptr, int size, int min, int max, bool mandatory);
  int addElementFloat(const std::string& name, float* ptr, int size, float min, float max,
                      bool mandatory);
  int addElementDouble(const std::string& name, double* ptr, int size, double min, double max,
                       bool mandatory);
  int addElementString(const std::string& name, std::string* ptr, bool mandatory);
  // ptr is the first of `size` strings.
  int addElementString(const std::string& name, std::string* ptr, int size, bool mandatory);

  orvanexml& getXml() { return xml; }

 private:
  int addElement(const std::string& name, void* ptr, parElement::ParameterType type, int size,
                 double min, double max, bool mandatory);
  int readElement(const parElement& e, int size);
  int writeElement(const parElement& e);

  int numberOfElements = 0;
  int nextElement = 0;
  std::vector<parElement> elements;
  bool allocated = false;
  orvanexml xml;
  int auxChannel = 0;
  std::string auxFile;
  std::string auxClass;
};

class GeneralSAR_Base : public GeneralSAR_BaseXML {
 public:
  GeneralSAR_Base() = default;
  ~GeneralSAR_Base() override = default;
  // The .hdr form of an object, separate from the XML form; defaults do
  // nothing and return 0. (A derived class overriding one of the writehdr
  // overloads should add `using GeneralSAR_Base::writehdr;`.)
  virtual int writehdr();
  virtual int writehdr(const std::string& file);
  virtual int readhdr(const std::string& file);
};

// A processing tool: its element table opens with the five common values
// (memory budget in MB, report file and level, in-core and verbose flags),
// its block in a parameter document is named after the tool, and the
// life-pattern calls that are the same for every tool stand here.
class ProcessingTool : public GeneralSAR_Base {
 public:
  ProcessingTool(std::string className, std::string reportFilename)
      : ReportFilename(std::move(reportFilename)), className_(std::move(className)) {}

  int createBuffers() override { return createBuffersDefault(); }
  int destroyBuffers() override {
    setAllocationFlag(false);
    return 0;
  }
  int checkpar() {
    checkAuxiliaryFile();
    return 0;
  }
  // The tool's block of the document; a block that cannot be read leaves
  // the values as they were and still gives 0.
  int readpar(const std::string& file, int channel);
  int writepar(const std::string& file, int channel);
  // Closes the report; 0.
  int FinalizeProcessing(const std::string& file, int channel);
  // True, with ReportFilename set to it, when the tool's block names a
  // ConfigurationFile of its own (the tool then does not run).
  bool namesOtherConfiguration(const std::string& file, int channel);

  int Memory = 256;
  std::string ReportFilename;
  int ReportLevel = 1;
  int Incore = 0;
  int Verbose = 1;

 protected:
  // Registers the five common values, first in the table.
  void addCommonElements();
  const std::string& toolName() const { return className_; }

 private:
  std::string className_;
};

// The five values every processing configuration class carries, read and
// written at "<group>/<key>" of a channel of a parameter document
// (the common group is "generalProcessingConf").
class GeneralSAR_BaseConfiguration {
 public:
  GeneralSAR_BaseConfiguration() = default;
  virtual ~GeneralSAR_BaseConfiguration() = default;

  // 1 if the file is not a parameter document, else 0; values absent from
  // the group keep what they were.
  int readConf(const std::string& file, int channel, const std::string& group);
  // Stores the five values at "<group>/<key>" and saves; 0 / 1.
  int writeConf(const std::string& file, int channel, const std::string& group);
  void cloneConf(GeneralSAR_BaseConfiguration& target) const;

  int Memory = 256;
  int Incore = 0;
  int Verbose = 1;
  int ReportLevel = 1;
  std::string ReportFilename;
};
