#pragma once
// XML parameter documents: root "OrvaneXmlDoc" with "NumberOfChannels",
// "Description" and one "Channel" element (attribute "Number") per channel;
// inside a channel one block per class, inside a block one element per
// parameter, arrays as "val" children with a 1-based attribute "N".
//
// All calls return 0 on success and 1 on failure unless told otherwise.
// Element paths are relative to the channel element, slash separated.
#include <string>

struct _xmlDoc;
struct _xmlNode;
struct _xmlXPathContext;
struct _xmlXPathObject;

class orvanexml {
 public:
  orvanexml();
  // Opens path; a missing, unparsable or unrecognised file is replaced in
  // memory by a new empty document with the same path.
  explicit orvanexml(const std::string& path);
  ~orvanexml();
  orvanexml(const orvanexml&) = delete;
  orvanexml& operator=(const orvanexml&) = delete;

  // Closes what is open, then opens as the constructor does.
  int initXmlFile(const std::string& path);
  // Frees the XPath context and the document.
  int clean();
  // Saves, frees, re-parses the saved file and saves it again (the second
  // save gives the final indentation).
  int write();

  int readInt(int channel, const std::string& path, int* dst, int n);
  int writeInt(int channel, const std::string& path, const int* src, int n);
  int readFloat(int channel, const std::string& path, float* dst, int n);
  int writeFloat(int channel, const std::string& path, const float* src, int n);
  int readDouble(int channel, const std::string& path, double* dst, int n);
  int writeDouble(int channel, const std::string& path, const double* src, int n);
  // An array of strings is a run of same-named sibling elements.
  int readString(int channel, const std::string& path, std::string* dst, int n);
  int writeString(int channel, const std::string& path, const std::string* src, int n);

  // Opens path, replaces the description, writes and closes.
  int setDescription(const std::string& path, const std::string& text);

  // Number of nodes at the channel-relative path (0 if the channel is absent).
  int countNodes(int channel, const std::string& path);
  // Unlinks and frees every node at the channel-relative path; returns the
  // number removed.
  int removeNodes(int channel, const std::string& path);

  void setDebug(bool on) { debug = on; }
  bool getDebug() const { return debug; }
  bool isOpen() const { return documentOpen; }
  // True when the file last opened was a parameter document (false when it
  // was missing or foreign and a new document took its place).
  bool isRecognised() const { return recognised; }
  const std::string& getPath() const { return docPath; }
  int getNumberOfChannels() const { return numberOfChannels; }
  const std::string& getDescription() const { return description; }

 private:
  int open(const std::string& path);
  bool recognise();
  int newDocument();
  int evalXPath(const std::string& expr);
  int nodeCount() const;
  _xmlNode* nodeAt(int index) const;
  std::string channelPath(int channel) const;
  int createPath(int channel, const std::string& path, int n);
  _xmlNode* createNode(const std::string& absolutePath);
  int prepareWrite(int channel, const std::string& path, int n, std::string& valuePath);
  template <typename T>
  int readNumbers(int channel, const std::string& path, T* dst, int n, const char* word);
  template <typename T>
  int writeNumbers(int channel, const std::string& path, const T* src, int n);

  std::string docPath;
  bool documentOpen = false;
  _xmlDoc* doc = nullptr;
  _xmlNode* root = nullptr;
  _xmlNode* current = nullptr;
  _xmlXPathContext* context = nullptr;
  _xmlXPathObject* result = nullptr;
  bool debug = false;
  bool recognised = false;
  int numberOfChannels = 0;
  std::string description;
};
