// XML parameter documents on libxml2.
#include "product/orvane_xml.h"

#include <libxml/parser.h>
#include <libxml/tree.h>
#include <libxml/xmlerror.h>
#include <libxml/xmlsave.h>
#include <libxml/xpath.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>
#include <type_traits>
#include <vector>

#include "base/status.h"
#include "diag/report.h"

namespace {

const xmlChar* X(const char* s) { return reinterpret_cast<const xmlChar*>(s); }
const char* C(const xmlChar* s) { return reinterpret_cast<const char*>(s); }

// Parser and XPath complaints about foreign files stay quiet: an unusable
// file is simply replaced by a new document.
void quietStructured(void*, xmlErrorPtr) {}
void quietGeneric(void*, const char*, ...) {}

void silenceLibxml() {
  xmlSetStructuredErrorFunc(nullptr, quietStructured);
  xmlSetGenericErrorFunc(nullptr, quietGeneric);
}

constexpr int kParseOptions = XML_PARSE_NOBLANKS | XML_PARSE_NOERROR | XML_PARSE_NOWARNING |
                              XML_PARSE_NONET;

xmlDocPtr parseDocument(const std::string& path) {
  silenceLibxml();
  xmlKeepBlanksDefault(0);
  return xmlReadFile(path.c_str(), nullptr, kParseOptions);
}

std::string nodeText(xmlNodePtr node) {
  std::string out;
  if (xmlChar* content = xmlNodeGetContent(node)) {
    out = C(content);
    xmlFree(content);
  }
  return out;
}

// Replaces a node's content with literal text (no entity parsing).
void setNodeText(xmlNodePtr node, const std::string& text) {
  xmlNodeSetContent(node, nullptr);
  xmlNodeAddContentLen(node, X(text.c_str()), int(text.size()));
}

std::string format(const char* fmt, double v) {
  char buf[64];
  std::snprintf(buf, sizeof buf, fmt, v);
  return buf;
}

std::string formatValue(int v) { return std::to_string(v); }
std::string formatValue(float v) { return format("%.15g", double(v)); }
std::string formatValue(double v) { return format("%.15g", v); }

void convertText(const std::string& text, int& v) { v = std::atoi(text.c_str()); }
void convertText(const std::string& text, float& v) { v = float(std::atof(text.c_str())); }
void convertText(const std::string& text, double& v) { v = std::atof(text.c_str()); }

// Items of the legacy flat form: "a, b, c". Each item must convert.
bool scanItem(const std::string& item, int& v) {
  const char* s = item.c_str();
  char* end = nullptr;
  errno = 0;
  long x = std::strtol(s, &end, 10);
  if (end == s) return false;
  v = int(x);
  return true;
}
bool scanItem(const std::string& item, double& v) {
  const char* s = item.c_str();
  char* end = nullptr;
  double x = std::strtod(s, &end);
  if (end == s) return false;
  v = x;
  return true;
}

// A channel-relative path of plain element names ("Class/Element").
bool plainPath(const std::string& path) {
  if (path.empty()) return false;
  size_t pos = 0;
  while (true) {
    size_t slash = path.find('/', pos);
    std::string part = path.substr(pos, slash == std::string::npos ? std::string::npos : slash - pos);
    if (part.empty() || xmlValidateNCName(X(part.c_str()), 0) != 0) return false;
    if (slash == std::string::npos) return true;
    pos = slash + 1;
  }
}

template <typename T>
int scanFlat(const std::string& text, T* dst, int n) {
  size_t pos = 0;
  for (int i = 0; i < n; ++i) {
    if (pos > text.size()) return STATUS_BAD_CONDITION;
    size_t comma = text.find(',', pos);
    std::string item = text.substr(pos, comma == std::string::npos ? std::string::npos : comma - pos);
    if (!scanItem(item, dst[i])) return STATUS_BAD_CONDITION;
    if (comma == std::string::npos) {
      if (i + 1 < n) return STATUS_BAD_CONDITION;
      break;
    }
    pos = comma + 1;
  }
  return 0;
}

}  // namespace

orvanexml::orvanexml() = default;

orvanexml::orvanexml(const std::string& path) { open(path); }

orvanexml::~orvanexml() { clean(); }

int orvanexml::initXmlFile(const std::string& path) {
  clean();
  return open(path);
}

int orvanexml::clean() {
  if (result != nullptr) {
    xmlXPathFreeObject(result);
    result = nullptr;
  }
  if (context != nullptr) {
    xmlXPathFreeContext(context);
    context = nullptr;
  }
  if (doc != nullptr) {
    xmlFreeDoc(doc);
    doc = nullptr;
  }
  root = nullptr;
  current = nullptr;
  documentOpen = false;
  return 0;
}

int orvanexml::open(const std::string& path) {
  docPath = path;
  recognised = false;
  numberOfChannels = 0;
  description.clear();
  bool parsed = false;
  if (std::FILE* fp = std::fopen(path.c_str(), "r")) {
    std::fclose(fp);
    doc = parseDocument(path);
    if (doc != nullptr) {
      root = xmlDocGetRootElement(doc);
      context = xmlXPathNewContext(doc);
      documentOpen = true;
      parsed = context != nullptr && recognise();
    }
  }
  recognised = parsed;
  if (!parsed) {
    clean();
    return newDocument();
  }
  return 0;
}

bool orvanexml::recognise() {
  static const char* const kCount = "/OrvaneXmlDoc/NumberOfChannels";
  static const char* const kDescription = "/OrvaneXmlDoc/Description";
  if (evalXPath(kCount) != 0 || nodeCount() < 1) {
    if (debug) std::fprintf(stderr, "File not recognized: %s does not exist\n", kCount);
    return false;
  }
  std::string count = nodeText(nodeAt(0));
  if (evalXPath(kDescription) != 0 || nodeCount() < 1) {
    if (debug) std::fprintf(stderr, "File not recognized: %s does not exist\n", kDescription);
    return false;
  }
  description = nodeText(nodeAt(0));
  numberOfChannels = 0;
  std::sscanf(count.c_str(), "%d", &numberOfChannels);
  return true;
}

int orvanexml::newDocument() {
  silenceLibxml();
  doc = xmlNewDoc(X("1.0"));
  if (doc == nullptr) return STATUS_BAD_CONDITION;
  root = xmlNewDocNode(doc, nullptr, X("OrvaneXmlDoc"), nullptr);
  xmlDocSetRootElement(doc, root);
  xmlNewTextChild(root, nullptr, X("NumberOfChannels"), X("0"));
  xmlNewTextChild(root, nullptr, X("Description"), X("My description"));
  context = xmlXPathNewContext(doc);
  numberOfChannels = 0;
  description = "My description";
  documentOpen = context != nullptr;
  return documentOpen ? 0 : 1;
}

int orvanexml::evalXPath(const std::string& expr) {
  if (result != nullptr) {
    xmlXPathFreeObject(result);
    result = nullptr;
  }
  if (context == nullptr) return STATUS_BAD_CONDITION;
  result = xmlXPathEvalExpression(X(expr.c_str()), context);
  if (result == nullptr) return STATUS_BAD_CONDITION;
  if (result->type != XPATH_NODESET) {
    xmlXPathFreeObject(result);
    result = nullptr;
    return STATUS_BAD_CONDITION;
  }
  return 0;
}

int orvanexml::nodeCount() const {
  if (result == nullptr || result->nodesetval == nullptr) return 0;
  return result->nodesetval->nodeNr;
}

_xmlNode* orvanexml::nodeAt(int index) const {
  if (index < 0 || index >= nodeCount()) return nullptr;
  return result->nodesetval->nodeTab[index];
}

std::string orvanexml::channelPath(int channel) const {
  return "/OrvaneXmlDoc/Channel[@Number=\"" + std::to_string(channel) + "\"]";
}

int orvanexml::countNodes(int channel, const std::string& path) {
  if (!documentOpen) return 0;
  if (evalXPath(channelPath(channel) + "/" + path) != 0) return 0;
  return nodeCount();
}

int orvanexml::removeNodes(int channel, const std::string& path) {
  if (!documentOpen) return 0;
  if (evalXPath(channelPath(channel) + "/" + path) != 0) return 0;
  std::vector<xmlNodePtr> nodes;
  for (int i = 0; i < nodeCount(); ++i) nodes.push_back(nodeAt(i));
  xmlXPathFreeObject(result);
  result = nullptr;
  for (xmlNodePtr node : nodes) xmlUnlinkNode(node);
  for (xmlNodePtr node : nodes) xmlFreeNode(node);
  current = nullptr;
  return int(nodes.size());
}

// Creates the node at an absolute path, parent first; returns the first node
// at that path.
_xmlNode* orvanexml::createNode(const std::string& absolutePath) {
  if (evalXPath(absolutePath) == 0 && nodeCount() > 0) return nodeAt(0);
  size_t slash = absolutePath.rfind('/');
  if (slash == std::string::npos || slash == 0) return nullptr;
  std::string name = absolutePath.substr(slash + 1);
  // Only plain element names are created; anything else would make the
  // saved document unreadable.
  if (name.empty() || xmlValidateNCName(X(name.c_str()), 0) != 0) return nullptr;
  xmlNodePtr parent = createNode(absolutePath.substr(0, slash));
  if (parent == nullptr) return nullptr;
  return xmlNewTextChild(parent, nullptr, X(name.c_str()), nullptr);
}

int orvanexml::createPath(int channel, const std::string& path, int n) {
  if (!plainPath(path)) return STATUS_BAD_CONDITION;
  const std::string chan = channelPath(channel);
  if (evalXPath(chan) != 0) return STATUS_BAD_CONDITION;
  if (nodeCount() == 0) {
    xmlNodePtr node = xmlNewTextChild(root, nullptr, X("Channel"), nullptr);
    xmlNewProp(node, X("Number"), X(std::to_string(channel).c_str()));
    ++numberOfChannels;
    if (evalXPath("/OrvaneXmlDoc/NumberOfChannels") == 0 && nodeCount() > 0)
      setNodeText(nodeAt(0), std::to_string(numberOfChannels));
  }
  const std::string full = chan + "/" + path;
  xmlNodePtr first = createNode(full);
  if (first == nullptr) return STATUS_BAD_CONDITION;
  if (n > 1) {
    if (evalXPath(full) != 0) return STATUS_BAD_CONDITION;
    int have = nodeCount();
    std::string name = C(first->name);
    for (int i = have; i < n; ++i) xmlNewTextChild(first->parent, nullptr, X(name.c_str()), nullptr);
  }
  return 0;
}

int orvanexml::prepareWrite(int channel, const std::string& path, int n, std::string& valuePath) {
  if (!documentOpen || path.empty()) return STATUS_BAD_CONDITION;
  valuePath = n < 2 ? path : path + "/val";
  if (countNodes(channel, valuePath) < n && createPath(channel, valuePath, n) != 0) return STATUS_BAD_CONDITION;
  if (evalXPath(channelPath(channel) + "/" + valuePath) != 0 || nodeCount() < n) return STATUS_BAD_CONDITION;
  return 0;
}

template <typename T>
int orvanexml::writeNumbers(int channel, const std::string& path, const T* src, int n) {
  if (n <= 0) return 0;
  if (src == nullptr) return STATUS_BAD_CONDITION;
  std::string valuePath;
  if (prepareWrite(channel, path, n, valuePath) != 0) return STATUS_BAD_CONDITION;
  for (int i = 0; i < n; ++i) {
    xmlNodePtr node = nodeAt(i);
    setNodeText(node, formatValue(src[i]));
    if (n > 1) xmlSetProp(node, X("N"), X(std::to_string(i + 1).c_str()));
  }
  return 0;
}

template <typename T>
int orvanexml::readNumbers(int channel, const std::string& path, T* dst, int n, const char* word) {
  if (n <= 0) return 0;
  if (dst == nullptr || !documentOpen || path.empty()) return STATUS_BAD_CONDITION;
  if (countNodes(channel, path) == 0) {
    if (debug)
      ORV_REPORT("Cannot read " + std::string(word) + " '" + path + "' in channel " +
                     std::to_string(channel) + ", from XML file " + docPath,
                 REPORT_WARNING);
    return STATUS_BAD_CONDITION;
  }
  const std::string element = channelPath(channel) + "/" + path;
  const std::string valuePath = n < 2 ? element : element + "/val";
  if (evalXPath(valuePath) == 0 && nodeCount() > 0) {
    const int have = nodeCount();
    for (int i = 0; i < n && i < have; ++i) convertText(nodeText(nodeAt(i)), dst[i]);
    if (have < n) {
      if (debug)
        std::fprintf(stderr, "File not recognized: %s does not exist\n", valuePath.c_str());
      return STATUS_BAD_CONDITION;
    }
    return 0;
  }
  // Legacy flat form: one text, items separated by a comma and a blank.
  if (evalXPath(element) != 0 || nodeCount() < 1) return STATUS_BAD_CONDITION;
  const std::string text = nodeText(nodeAt(0));
  if constexpr (std::is_same_v<T, float>) {
    std::vector<double> tmp(size_t(n), 0.0);
    int rc = scanFlat(text, tmp.data(), n);
    for (int i = 0; i < n; ++i) dst[i] = float(tmp[size_t(i)]);
    return rc;
  } else {
    return scanFlat(text, dst, n);
  }
}

int orvanexml::readInt(int channel, const std::string& path, int* dst, int n) {
  return readNumbers(channel, path, dst, n, "int");
}
int orvanexml::writeInt(int channel, const std::string& path, const int* src, int n) {
  return writeNumbers(channel, path, src, n);
}
int orvanexml::readFloat(int channel, const std::string& path, float* dst, int n) {
  return readNumbers(channel, path, dst, n, "float");
}
int orvanexml::writeFloat(int channel, const std::string& path, const float* src, int n) {
  return writeNumbers(channel, path, src, n);
}
int orvanexml::readDouble(int channel, const std::string& path, double* dst, int n) {
  return readNumbers(channel, path, dst, n, "double");
}
int orvanexml::writeDouble(int channel, const std::string& path, const double* src, int n) {
  return writeNumbers(channel, path, src, n);
}

int orvanexml::readString(int channel, const std::string& path, std::string* dst, int n) {
  if (n <= 0) return 0;
  if (dst == nullptr || !documentOpen || path.empty()) return STATUS_BAD_CONDITION;
  if (countNodes(channel, path) < n) {
    if (debug)
      ORV_REPORT("Cannot read string '" + path + "' in channel " + std::to_string(channel) +
                     ", from XML file " + docPath,
                 REPORT_WARNING);
    return STATUS_BAD_CONDITION;
  }
  for (int i = 0; i < n; ++i) dst[i] = nodeText(nodeAt(i));
  return 0;
}

int orvanexml::writeString(int channel, const std::string& path, const std::string* src, int n) {
  if (n <= 0) return 0;
  if (src == nullptr) return STATUS_BAD_CONDITION;
  std::string valuePath;
  // Strings have no "val" form: an array is a run of same-named siblings.
  if (!documentOpen || path.empty()) return STATUS_BAD_CONDITION;
  if (countNodes(channel, path) < n && createPath(channel, path, n) != 0) return STATUS_BAD_CONDITION;
  if (evalXPath(channelPath(channel) + "/" + path) != 0 || nodeCount() < n) return STATUS_BAD_CONDITION;
  for (int i = 0; i < n; ++i) {
    xmlNodePtr node = nodeAt(i);
    setNodeText(node, src[i]);
    if (n > 1) xmlSetProp(node, X("N"), X(std::to_string(i + 1).c_str()));
  }
  return 0;
}

int orvanexml::write() {
  if (!documentOpen || doc == nullptr) return STATUS_BAD_CONDITION;
  if (xmlSaveFormatFileEnc(docPath.c_str(), doc, "UTF-8", 1) < 0) return STATUS_BAD_CONDITION;
  clean();
  // Parsed again with blanks dropped, the second save gets clean indentation.
  doc = parseDocument(docPath);
  if (doc == nullptr) {
    newDocument();
    return STATUS_BAD_CONDITION;
  }
  root = xmlDocGetRootElement(doc);
  context = xmlXPathNewContext(doc);
  documentOpen = context != nullptr;
  if (xmlSaveFormatFileEnc(docPath.c_str(), doc, "UTF-8", 1) < 0) return STATUS_BAD_CONDITION;
  return 0;
}

int orvanexml::setDescription(const std::string& path, const std::string& text) {
  initXmlFile(path);
  if (!documentOpen) return STATUS_BAD_CONDITION;
  if (evalXPath("/OrvaneXmlDoc/Description") != 0 || nodeCount() < 1) return STATUS_BAD_CONDITION;
  setNodeText(nodeAt(0), text);
  description = text;
  int rc = write();
  clean();
  return rc;
}
