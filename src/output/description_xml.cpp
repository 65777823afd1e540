// The ".sml" form of the description headers: direct text output, and the
// expat stream parser feeding an element tree that is walked into sections.
#include "output/description_xml.h"

#include <expat.h>

#include <cerrno>
#include <cstdio>
#include <fstream>
#include <memory>
#include <sstream>

#include "base/status.h"
#include "diag/environment.h"
#include "diag/report.h"

namespace {

constexpr int kMaxDepth = 256;
constexpr const char* kEmptyText = "IS_EMPTY";

// ---------------------------------------------------------------- parser

struct ParseState {
  tesv_xml_node* root = nullptr;
  std::vector<tesv_xml_node*> stack;
  bool rootSeen = false;
  std::string error;
  XML_Parser parser = nullptr;
};

void XMLCALL onStart(void* data, const XML_Char* name, const XML_Char** attributes) {
  auto* state = static_cast<ParseState*>(data);
  tesv_xml_node* node = nullptr;
  if (state->stack.empty()) {
    node = state->root;
    state->rootSeen = true;
  } else {
    if (state->stack.size() >= static_cast<std::size_t>(kMaxDepth)) {
      state->error = "elements nested too deeply";
      XML_StopParser(state->parser, XML_FALSE);
      return;
    }
    state->stack.back()->children.emplace_back();
    node = &state->stack.back()->children.back();
  }
  node->tag = name;
  for (int i = 0; attributes[i] != nullptr; i += 2)
    node->attributes.emplace_back(attributes[i], attributes[i + 1]);
  state->stack.push_back(node);
}

void XMLCALL onEnd(void* data, const XML_Char*) {
  auto* state = static_cast<ParseState*>(data);
  if (!state->stack.empty()) state->stack.pop_back();
}

void XMLCALL onText(void* data, const XML_Char* text, int length) {
  auto* state = static_cast<ParseState*>(data);
  if (!state->stack.empty()) state->stack.back()->text.append(text, static_cast<std::size_t>(length));
}

struct ParserDeleter {
  void operator()(XML_ParserStruct* p) const { XML_ParserFree(p); }
};

// ---------------------------------------------------------------- writer

class XmlWriter {
 public:
  std::string out;

  void line(int depth, const std::string& text) {
    out.append(static_cast<std::size_t>(depth), '\t');
    out += text;
    out += '\n';
  }
  static std::string start(const std::string& tag) { return "<" + std::string() + tag + ">"; }
  static std::string end(const std::string& tag) { return "</" + std::string() + tag + ">"; }
  void leaf(int depth, const std::string& tag, const std::string& text) {
    line(depth, start(tag) + tesv_xml_escape(text) + end(tag));
  }

  static std::string valueText(const tesv_description_field& f, std::size_t i) {
    switch (f.type) {
      case FT_INTEGER: return std::to_string(f.ints[i]);
      case FT_DOUBLE: return descriptionDoubleText(f.doubles[i]);
      default: return f.strings[i].empty() ? kEmptyText : f.strings[i];
    }
  }

  void section(int depth, const tesv_description_section& s) {
    line(depth, start("SECTION"));
    leaf(depth + 1, "NAME", s.name);
    body(depth + 1, s);
    line(depth, end("SECTION"));
  }

  // Count, fields and non-empty sub-sections of a section or the root.
  void body(int depth, const tesv_description_section& s) {
    int count = static_cast<int>(s.fields.size());
    for (const auto& sub : s.sections) count += written(sub) ? 1 : 0;
    leaf(depth, "NumberOfElements", std::to_string(count));
    for (const auto& f : s.fields) field(depth, f);
    for (const auto& sub : s.sections)
      if (written(sub)) section(depth, sub);
  }

  static bool written(const tesv_description_section& s) {
    return !s.fields.empty() || !s.sections.empty();
  }

  void field(int depth, const tesv_description_field& f) {
    line(depth, "<FIELD NAME = \"" + tesv_xml_escape(f.name) + "\" MANDATORY = \"" +
                    (f.mandatory ? "1" : "0") + "\">");
    if (f.shape == FS_MULTIPLE) {
      line(depth + 1, start("Multi"));
      leaf(depth + 2, "NumberOfElements", std::to_string(f.subFields.size()));
      for (const auto& sub : f.subFields) field(depth + 2, sub);
      line(depth + 1, end("Multi"));
    } else if (f.type == FT_FIELD_OF_SECTION) {
      structs(depth + 1, f);
    } else {
      values(depth + 1, f);
    }
    line(depth, end("FIELD"));
  }

  void structs(int depth, const tesv_description_field& f) {
    line(depth, start("EFDT"));
    if (f.shape == FS_VECTOR) {
      line(depth + 1, start("VectorOfStructs"));
      leaf(depth + 2, "NumberOfElements", std::to_string(f.sections.size()));
      line(depth + 2, start("VectorOfStructsValues"));
      for (const auto& s : f.sections) section(depth + 3, s);
      line(depth + 2, end("VectorOfStructsValues"));
      line(depth + 1, end("VectorOfStructs"));
    } else {
      line(depth + 1, start("Struct"));
      for (const auto& s : f.sections) section(depth + 2, s);
      line(depth + 1, end("Struct"));
    }
    line(depth, end("EFDT"));
  }

  void values(int depth, const tesv_description_field& f) {
    std::string typeTag = f.type == FT_INTEGER ? "Integer" : f.type == FT_DOUBLE ? "Double" : "String";
    std::size_t n = static_cast<std::size_t>(f.numberOfElements());
    line(depth, start(typeTag));
    if (f.shape == FS_VECTOR) {
      leaf(depth + 1, "NumberOfElements", std::to_string(n));
      line(depth + 1, start("Vector"));
      for (std::size_t i = 0; i < n; ++i) leaf(depth + 2, "Value", valueText(f, i));
      line(depth + 1, end("Vector"));
    } else if (f.shape == FS_MATRIX) {
      line(depth + 1, "<Matrix ROWS = \"" + std::to_string(f.rows) + "\" COLUMNS = \"" +
                          std::to_string(f.cols) + "\">");
      for (int r = 0; r < f.rows; ++r) {
        line(depth + 2, start("MatrixRow"));
        for (int c = 0; c < f.cols; ++c) {
          std::size_t i = static_cast<std::size_t>(r) * static_cast<std::size_t>(f.cols) +
                          static_cast<std::size_t>(c);
          leaf(depth + 3, "Value", i < n ? valueText(f, i) : std::string(kEmptyText));
        }
        line(depth + 2, end("MatrixRow"));
      }
      line(depth + 1, end("Matrix"));
    } else {
      leaf(depth + 1, "Value", n > 0 ? valueText(f, 0) : std::string(kEmptyText));
    }
    line(depth, end(typeTag));
  }
};

// ---------------------------------------------------------------- tree walk

class TreeReader {
 public:
  std::string error;

  bool section(const tesv_xml_node& node, tesv_description_section& s) {
    const auto* name = node.child("NAME");
    if (!name) return fail("SECTION without NAME");
    s.name = tesv_decode_temporary_escapes(name->text);
    return body(node, s);
  }

  bool body(const tesv_xml_node& node, tesv_description_section& s) {
    long long expected = -1;
    for (const auto& child : node.children) {
      if (child.tag == "NumberOfElements") {
        if (!count(child, expected)) return false;
      } else if (child.tag == "FIELD") {
        tesv_description_field f;
        if (!field(child, f)) return false;
        s.fields.push_back(std::move(f));
      } else if (child.tag == "SECTION") {
        tesv_description_section sub;
        if (!section(child, sub)) return false;
        s.sections.push_back(std::move(sub));
      } else if (child.tag != "NAME") {
        return fail("unexpected element " + child.tag + " in section " + s.name);
      }
    }
    long long found = static_cast<long long>(s.fields.size() + s.sections.size());
    if (expected >= 0 && expected != found)
      return fail("section " + s.name + " announces " + std::to_string(expected) +
                  " elements and holds " + std::to_string(found));
    return true;
  }

  bool field(const tesv_xml_node& node, tesv_description_field& f) {
    const auto* name = node.attribute("NAME");
    if (!name) return fail("FIELD without NAME");
    f.name = tesv_decode_temporary_escapes(*name);
    const auto* mandatory = node.attribute("MANDATORY");
    f.mandatory = mandatory && (*mandatory == "1" || *mandatory == "true");
    if (node.children.size() != 1) return fail("field " + f.name + " holds no single value element");
    const tesv_xml_node& content = node.children.front();
    if (content.tag == "Multi") {
      std::vector<tesv_description_field> subs;
      long long expected = -1;
      for (const auto& child : content.children) {
        if (child.tag == "NumberOfElements") {
          if (!count(child, expected)) return false;
        } else if (child.tag == "FIELD") {
          subs.emplace_back();
          if (!field(child, subs.back())) return false;
        } else {
          return fail("unexpected element " + child.tag + " in field " + f.name);
        }
      }
      if (expected >= 0 && expected != static_cast<long long>(subs.size()))
        return fail("field " + f.name + " announces " + std::to_string(expected) + " sub-fields");
      f.setMultiple(subs);
      return true;
    }
    if (content.tag == "EFDT") return structs(content, f);
    int type = content.tag == "Integer" ? FT_INTEGER
               : content.tag == "Double" ? FT_DOUBLE
               : content.tag == "String" ? FT_STRING
                                         : FT_NOT_SET;
    if (type == FT_NOT_SET) return fail("unknown type element " + content.tag + " in field " + f.name);
    return values(content, type, f);
  }

  bool structs(const tesv_xml_node& node, tesv_description_field& f) {
    if (node.children.size() != 1) return fail("field " + f.name + ": EFDT holds one element");
    const auto& shape = node.children.front();
    std::vector<tesv_description_section> list;
    const tesv_xml_node* holder = &shape;
    long long expected = -1;
    if (shape.tag == "VectorOfStructs") {
      if (const auto* n = shape.child("NumberOfElements"))
        if (!count(*n, expected)) return false;
      holder = shape.child("VectorOfStructsValues");
      if (!holder) return fail("field " + f.name + ": VectorOfStructs without values");
    } else if (shape.tag != "Struct") {
      return fail("field " + f.name + ": unexpected element " + shape.tag);
    }
    for (const auto& child : holder->children) {
      if (child.tag != "SECTION") return fail("field " + f.name + ": unexpected element " + child.tag);
      list.emplace_back();
      if (!section(child, list.back())) return false;
    }
    if (expected >= 0 && expected != static_cast<long long>(list.size()))
      return fail("field " + f.name + " announces " + std::to_string(expected) + " structures");
    f.setSections(list, shape.tag == "VectorOfStructs");
    return true;
  }

  bool values(const tesv_xml_node& node, int type, tesv_description_field& f) {
    if (const auto* value = node.child("Value")) {
      std::string text = tesv_decode_temporary_escapes(value->text);
      if (text == kEmptyText) {
        f.setEmpty(type);
        if (type == FT_STRING) f.strings.emplace_back();
        return true;
      }
      std::vector<std::string> one{text};
      if (!store(one, type, f)) return false;
      f.shape = FS_SCALAR;
      return true;
    }
    if (const auto* vector = node.child("Vector")) {
      long long expected = -1;
      if (const auto* n = node.child("NumberOfElements"))
        if (!count(*n, expected)) return false;
      std::vector<std::string> texts;
      for (const auto& v : vector->children) texts.push_back(decodedValue(v));
      if (expected >= 0 && expected != static_cast<long long>(texts.size()))
        return fail("field " + f.name + " announces " + std::to_string(expected) + " elements");
      if (!store(texts, type, f)) return false;
      f.shape = FS_VECTOR;
      return true;
    }
    if (const auto* matrix = node.child("Matrix")) {
      long long nRows = 0, nCols = 0;
      const auto* r = matrix->attribute("ROWS");
      const auto* c = matrix->attribute("COLUMNS");
      if (!r || !c || !parseDescriptionInt(*r, nRows) || !parseDescriptionInt(*c, nCols) ||
          nRows < 0 || nCols < 0)
        return fail("field " + f.name + ": matrix without its size");
      std::vector<std::string> texts;
      long long rowsSeen = 0;
      for (const auto& row : matrix->children) {
        if (row.tag != "MatrixRow") return fail("field " + f.name + ": unexpected element " + row.tag);
        if (static_cast<long long>(row.children.size()) != nCols)
          return fail("field " + f.name + ": matrix row of the wrong length");
        for (const auto& v : row.children) texts.push_back(decodedValue(v));
        ++rowsSeen;
      }
      if (rowsSeen != nRows) return fail("field " + f.name + ": matrix of the wrong row count");
      if (!store(texts, type, f)) return false;
      f.shape = FS_MATRIX;
      f.rows = static_cast<int>(nRows);
      f.cols = static_cast<int>(nCols);
      return true;
    }
    return fail("field " + f.name + " holds no value");
  }

 private:
  static std::string decodedValue(const tesv_xml_node& v) {
    std::string text = tesv_decode_temporary_escapes(v.text);
    return text == kEmptyText ? std::string() : text;
  }

  bool store(const std::vector<std::string>& texts, int type, tesv_description_field& f) {
    f.setEmpty(type);
    for (const auto& t : texts) {
      if (type == FT_STRING) {
        f.strings.push_back(t);
      } else if (type == FT_INTEGER) {
        long long v = 0;
        if (!parseDescriptionInt(t, v)) return fail("field " + f.name + ": bad integer [" + t + "]");
        f.ints.push_back(v);
      } else {
        double v = 0.0;
        if (!parseDescriptionDouble(t, v)) return fail("field " + f.name + ": bad double [" + t + "]");
        f.doubles.push_back(v);
      }
    }
    return true;
  }

  bool count(const tesv_xml_node& node, long long& value) {
    std::string t = node.text;
    auto b = t.find_first_not_of(" \t\r\n");
    auto e = t.find_last_not_of(" \t\r\n");
    t = b == std::string::npos ? std::string() : t.substr(b, e - b + 1);
    if (!parseDescriptionInt(t, value) || value < 0) return fail("bad NumberOfElements [" + t + "]");
    return true;
  }

  bool fail(const std::string& message) {
    if (error.empty()) error = message;
    return false;
  }
};

}  // namespace

const tesv_xml_node* tesv_xml_node::child(const std::string& name) const {
  for (const auto& c : children)
    if (c.tag == name) return &c;
  return nullptr;
}

const std::string* tesv_xml_node::attribute(const std::string& name) const {
  for (const auto& a : attributes)
    if (a.first == name) return &a.second;
  return nullptr;
}

int ftesv_xml_parser(const std::string& document, tesv_xml_node& root, std::string& error) {
  root = tesv_xml_node();
  std::unique_ptr<XML_ParserStruct, ParserDeleter> parser(XML_ParserCreate(nullptr));
  if (!parser) {
    error = "cannot create the XML parser";
    return STATUS_NO_MEMORY;
  }
  ParseState state;
  state.root = &root;
  state.parser = parser.get();
  XML_SetUserData(parser.get(), &state);
  XML_SetElementHandler(parser.get(), onStart, onEnd);
  XML_SetCharacterDataHandler(parser.get(), onText);
  if (document.size() > static_cast<std::size_t>(0x7fffffff)) {
    error = "document too large";
    return STATUS_BAD_CONDITION;
  }
  if (XML_Parse(parser.get(), document.data(), static_cast<int>(document.size()), XML_TRUE) ==
      XML_STATUS_ERROR) {
    char position[96];
    std::snprintf(position, sizeof position, " at line %lu, column %lu",
                  static_cast<unsigned long>(XML_GetCurrentLineNumber(parser.get())),
                  static_cast<unsigned long>(XML_GetCurrentColumnNumber(parser.get())));
    error = state.error.empty() ? XML_ErrorString(XML_GetErrorCode(parser.get())) : state.error;
    error += position;
    return STATUS_BAD_CONDITION;
  }
  if (!state.rootSeen) {
    error = "no element found";
    return STATUS_BAD_CONDITION;
  }
  return STATUS_OK;
}

std::string tesv_xml_escape(const std::string& text) {
  std::string out;
  out.reserve(text.size());
  for (char ch : text) {
    switch (ch) {
      case '&': out += "&amp;"; break;
      case '<': out += "&lt;"; break;
      case '>': out += "&gt;"; break;
      case '"': out += "&quot;"; break;
      case '\'': out += "&apos;"; break;
      default: out += ch;
    }
  }
  return out;
}

std::string tesv_decode_temporary_escapes(const std::string& text) {
  if (text.find("##") == std::string::npos) return text;
  static const struct {
    const char* code;
    const char* replacement;
  } table[] = {{"####BIG", ""}, {"##quot", "\""}, {"##apos", "'"},
               {"##amp", "&"},  {"##lt", "<"},    {"##gt", ">"}};
  std::string out;
  out.reserve(text.size());
  std::size_t i = 0;
  while (i < text.size()) {
    bool replaced = false;
    if (text[i] == '#') {
      for (const auto& entry : table) {
        std::size_t n = std::char_traits<char>::length(entry.code);
        if (text.compare(i, n, entry.code) == 0) {
          out += entry.replacement;
          i += n;
          replaced = true;
          break;
        }
      }
    }
    if (!replaced) out += text[i++];
  }
  return out;
}

std::string tesv_program_name() {
  std::string name = program_invocation_short_name ? program_invocation_short_name : "";
  return name.empty() ? std::string("stripmap_focuser") : name;
}

std::string tesv_description_xml_text(tesv_description_section& root) {
  if (auto* raster = root.findSection("RasterInfo")) raster->setField("SOFTWARE").setString(tesv_program_name());
  XmlWriter writer;
  writer.out = "<?xml version=\"1.0\" ?>\n";
  if (root.name.find("HEADER_INFO") != std::string::npos) {
    std::string ns = kHeaderSchemaNamespace;
    writer.out += "<" + root.name + "\n";
    writer.out += "\txmlns=\"" + ns + "\"\n";
    writer.out += "\txmlns:xsi=\"http://www.w3.org/2001/XMLSchema-instance\"\n";
    writer.out += "\txsi:schemaLocation=\"" + ns + "\n\t" + ns + "/" + kHeaderSchemaFile + "\">\n";
  } else {
    writer.out += "<" + root.name + ">\n";
  }
  writer.body(1, root);
  writer.out += "</" + root.name + ">\n";
  return writer.out;
}

int tesv_write_description_xml(tesv_description_section& root, const std::string& file) {
  std::string text = tesv_description_xml_text(root);
  std::FILE* out = std::fopen(file.c_str(), "wb");
  if (!out) {
    ORV_REPORT("File not opened! " + file, REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  bool ok = std::fwrite(text.data(), 1, text.size(), out) == text.size();
  ok = (std::fclose(out) == 0) && ok;
  if (!ok) {
    ORV_REPORT("File writing failed! " + file, REPORT_ERROR);
    return STATUS_WRITE_FAILED;
  }
  return STATUS_OK;
}

int tesv_parse_description_xml(const std::string& document, tesv_description_section& root,
                               const std::string& initialTag, std::string* error) {
  std::string message;
  tesv_xml_node tree;
  if (tracingActive()) traceWrite("before ftesv_xml_parser : %s\n", initialTag.c_str());
  int status = ftesv_xml_parser(document, tree, message);
  if (tracingActive()) traceWrite("after ftesv_xml_parser : %d\n", status);
  if (status != STATUS_OK) {
    ORV_REPORT(message, REPORT_ERROR);
    if (error) *error = message;
    return status == STATUS_BAD_CONDITION ? STATUS_READ_FAILED : status;
  }
  bool parameterRoot = initialTag.find("PARAMETERS_INFO_") != std::string::npos &&
                       tree.tag.find("PARAMETERS_INFO_") != std::string::npos;
  if (tree.tag != initialTag && !parameterRoot) {
    message = "NOT FOUND this->mInitialTag : " + initialTag;
    ORV_REPORT(message, REPORT_ERROR);
    if (error) *error = message;
    return STATUS_BAD_CONDITION;
  }
  tesv_description_section result(tree.tag);
  TreeReader reader;
  if (!reader.body(tree, result)) {
    ORV_REPORT(reader.error, REPORT_ERROR);
    if (error) *error = reader.error;
    return STATUS_BAD_CONDITION;
  }
  root = std::move(result);
  return STATUS_OK;
}

int tesv_read_description_xml(const std::string& file, tesv_description_section& root,
                              const std::string& initialTag, std::string* error) {
  std::ifstream in(file, std::ios::binary);
  if (!in) {
    ORV_REPORT("File not opened! " + file, REPORT_ERROR);
    if (error) *error = "File not opened! " + file;
    return STATUS_NOT_OPENED;
  }
  std::ostringstream text;
  text << in.rdbuf();
  if (in.bad()) {
    ORV_REPORT("File reading failed! " + file, REPORT_ERROR);
    if (error) *error = "File reading failed! " + file;
    return STATUS_READ_FAILED;
  }
  std::string message;
  int status = tesv_parse_description_xml(text.str(), root, initialTag, &message);
  if (status != STATUS_OK) message = file + ": " + message;
  if (error) *error = message;
  return status;
}
