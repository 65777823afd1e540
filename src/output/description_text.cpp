// Text form of the description headers.
#include "output/description_text.h"

#include <cstdio>
#include <cstring>
#include <memory>

#include "base/status.h"
#include "diag/environment.h"
#include "diag/report.h"
#include "output/description_xml.h"
#include "output/work_pool.h"

namespace {

constexpr const char* kEmptyText = "IS_EMPTY";

struct FileCloser {
  void operator()(std::FILE* f) const { std::fclose(f); }
};
using FilePtr = std::unique_ptr<std::FILE, FileCloser>;

std::string trim(const std::string& s) {
  auto b = s.find_first_not_of(" \t\r\n");
  if (b == std::string::npos) return std::string();
  auto e = s.find_last_not_of(" \t\r\n");
  return s.substr(b, e - b + 1);
}

// Section name of a "[Name]" line, empty when the line is not one.
std::string sectionOfLine(const std::string& line) {
  std::string t = trim(line);
  if (t.size() < 3 || t.front() != '[' || t.back() != ']' || t.find('=') != std::string::npos)
    return std::string();
  return trim(t.substr(1, t.size() - 2));
}

std::string decodeEntities(const std::string& text) {
  static const struct {
    const char* entity;
    char ch;
  } table[] = {{"&amp;", '&'}, {"&lt;", '<'}, {"&gt;", '>'}, {"&quot;", '"'}, {"&apos;", '\''}};
  std::string out;
  std::size_t i = 0;
  while (i < text.size()) {
    bool done = false;
    if (text[i] == '&') {
      for (const auto& e : table) {
        std::size_t n = std::strlen(e.entity);
        if (text.compare(i, n, e.entity) == 0) {
          out += e.ch;
          i += n;
          done = true;
          break;
        }
      }
    }
    if (!done) out += text[i++];
  }
  return out;
}

std::string valueText(const tesv_description_field& f, std::size_t i) {
  switch (f.type) {
    case FT_INTEGER: return std::to_string(f.ints[i]);
    case FT_DOUBLE: return descriptionDoubleText(f.doubles[i]);
    default: {
      std::string quoted(1, '"');
      quoted += tesv_xml_escape(f.strings[i]);
      quoted += '"';
      return quoted;
    }
  }
}

bool hasTextForm(const tesv_description_field& f) {
  return f.shape != FS_MULTIPLE && f.type != FT_FIELD_OF_SECTION && f.type != FT_NOT_SET;
}

void appendField(std::string& out, const tesv_description_field& f) {
  out += f.name + " = ";
  std::size_t n = static_cast<std::size_t>(f.numberOfElements());
  if (f.shape == FS_VECTOR) {
    out += "[";
    for (std::size_t i = 0; i < n; ++i) {
      out += ' ';
      out += valueText(f, i);
    }
    out += " ]";
  } else if (f.shape == FS_MATRIX) {
    out += "[";
    for (int r = 0; r < f.rows; ++r) {
      out += " [";
      for (int c = 0; c < f.cols; ++c) {
        std::size_t i = static_cast<std::size_t>(r) * static_cast<std::size_t>(f.cols) +
                        static_cast<std::size_t>(c);
        out += ' ';
        out += i < n ? valueText(f, i) : std::string("NaN");
      }
      out += " ]";
    }
    out += " ]";
  } else {
    out += n > 0 ? valueText(f, 0) : std::string(kEmptyText);
  }
  out += "\n";
}

// One token of a value: a quoted string, a bracket, or a word cut at tab,
// blank, '=' and the brackets.
struct Token {
  enum Kind { Word, Quoted, Open, Close } kind;
  std::string text;
};

bool tokenize(const std::string& value, std::vector<Token>& tokens, std::string& error) {
  std::size_t i = 0;
  while (i < value.size()) {
    char ch = value[i];
    if (ch == ' ' || ch == '\t' || ch == '=' || ch == '\r' || ch == '\n') {
      ++i;
    } else if (ch == '[') {
      tokens.push_back({Token::Open, "["});
      ++i;
    } else if (ch == ']') {
      tokens.push_back({Token::Close, "]"});
      ++i;
    } else if (ch == '"') {
      std::size_t end = value.find('"', i + 1);
      if (end == std::string::npos) {
        error = "unclosed quote";
        return false;
      }
      tokens.push_back({Token::Quoted, decodeEntities(value.substr(i + 1, end - i - 1))});
      i = end + 1;
    } else {
      std::size_t end = value.find_first_of(" \t=[]\r\n", i);
      if (end == std::string::npos) end = value.size();
      tokens.push_back({Token::Word, value.substr(i, end - i)});
      i = end;
    }
  }
  return true;
}

// Values of one field from its tokens.
bool fieldFromTokens(const std::vector<Token>& tokens, tesv_description_field& f, std::string& error) {
  std::vector<const Token*> items;
  int nRows = 0, nCols = -1, shape = FS_SCALAR;
  if (tokens.empty()) {
    error = "field without value";
    return false;
  }
  if (tokens.front().kind == Token::Open) {
    if (tokens.back().kind != Token::Close) {
      error = "unclosed bracket";
      return false;
    }
    bool matrix = tokens.size() > 2 && tokens[1].kind == Token::Open;
    shape = matrix ? FS_MATRIX : FS_VECTOR;
    int depth = 0, inRow = 0;
    for (std::size_t k = 0; k < tokens.size(); ++k) {
      const Token& t = tokens[k];
      if (t.kind == Token::Open) {
        if (++depth > (matrix ? 2 : 1)) {
          error = "brackets nested too deeply";
          return false;
        }
        inRow = 0;
      } else if (t.kind == Token::Close) {
        if (depth == 2) {
          if (nCols >= 0 && nCols != inRow) {
            error = "matrix rows of different lengths";
            return false;
          }
          nCols = inRow;
          ++nRows;
        }
        if (--depth < 0 || (depth == 0 && k + 1 != tokens.size())) {
          error = "unbalanced brackets";
          return false;
        }
      } else {
        if (matrix && depth != 2) {
          error = "matrix value outside a row";
          return false;
        }
        items.push_back(&t);
        ++inRow;
      }
    }
    if (depth != 0) {
      error = "unbalanced brackets";
      return false;
    }
  } else {
    if (tokens.size() != 1 || tokens.front().kind == Token::Close) {
      error = "more than one value outside brackets";
      return false;
    }
    if (tokens.front().kind == Token::Word && tokens.front().text == kEmptyText) {
      f.setEmpty(FT_STRING);
      return true;
    }
    items.push_back(&tokens.front());
  }

  bool quoted = false, allInt = true, allNumber = true;
  for (const Token* t : items) {
    long long iv = 0;
    double dv = 0.0;
    if (t->kind == Token::Quoted) quoted = true;
    if (!parseDescriptionInt(t->text, iv)) allInt = false;
    if (!parseDescriptionDouble(t->text, dv)) allNumber = false;
  }
  int type = quoted || !allNumber ? FT_STRING : allInt ? FT_INTEGER : FT_DOUBLE;
  f.setEmpty(type);
  for (const Token* t : items) {
    if (type == FT_STRING) {
      f.strings.push_back(t->text);
    } else if (type == FT_INTEGER) {
      long long v = 0;
      parseDescriptionInt(t->text, v);
      f.ints.push_back(v);
    } else {
      double v = 0.0;
      parseDescriptionDouble(t->text, v);
      f.doubles.push_back(v);
    }
  }
  f.shape = shape;
  if (shape == FS_MATRIX) {
    f.rows = nRows;
    f.cols = nCols < 0 ? 0 : nCols;
  }
  return true;
}

// Reads the next line of in into the pool buffer; false at the end. A line
// that does not fit sets tooLong.
bool nextLine(std::FILE* in, tesv_pool_buffer& buffer, std::string& line, bool& tooLong) {
  tooLong = false;
  if (!std::fgets(buffer.data(), static_cast<int>(buffer.size()), in)) return false;
  std::size_t n = std::strlen(buffer.data());
  if (n + 1 >= buffer.size() && buffer.data()[n - 1] != '\n') tooLong = true;
  line.assign(buffer.data(), n);
  while (!line.empty() && (line.back() == '\n' || line.back() == '\r')) line.pop_back();
  return true;
}

}  // namespace

std::string tesv_description_text(const tesv_description_section& root) {
  std::string out;
  for (const auto& f : root.fields)
    if (hasTextForm(f)) appendField(out, f);
  for (const auto& s : root.sections) {
    bool any = false;
    for (const auto& f : s.fields) any = any || hasTextForm(f);
    if (!any) continue;
    out += "[" + s.name + "]\n";
    for (const auto& f : s.fields)
      if (hasTextForm(f)) appendField(out, f);
    out += "\n";
  }
  return out;
}

int flocal_readOtherSectionFromFile(const std::string& file, const std::string& sectionName,
                                    std::string& text) {
  FilePtr in(std::fopen(file.c_str(), "rb"));
  if (!in) return STATUS_NOT_OPENED;
  tesv_pool_buffer buffer;
  std::string line;
  bool tooLong = false, inside = false, found = false;
  long aLinePos = 0;
  if (tracingActive()) traceWrite("SectionName = %s\n", sectionName.c_str());
  while (nextLine(in.get(), buffer, line, tooLong)) {
    ++aLinePos;
    std::string section = sectionOfLine(line);
    if (!section.empty()) {
      inside = section == sectionName;
      found = found || inside;
    }
    if (!inside) continue;
    if (tracingActive()) {
      traceWrite("aLine = %s\n", line.c_str());
      traceWrite("aLinePos = %ld\n", aLinePos);
    }
    text += line + "\n";
  }
  return found ? STATUS_OK : STATUS_BAD_CONDITION;
}

std::vector<std::string> tesv_text_section_names(const std::string& file) {
  std::vector<std::string> names;
  FilePtr in(std::fopen(file.c_str(), "rb"));
  if (!in) return names;
  tesv_pool_buffer buffer;
  std::string line;
  bool tooLong = false;
  while (nextLine(in.get(), buffer, line, tooLong)) {
    std::string section = sectionOfLine(line);
    if (section.empty()) continue;
    bool seen = false;
    for (const auto& n : names) seen = seen || n == section;
    if (!seen) names.push_back(section);
  }
  return names;
}

int tesv_write_description_text(tesv_description_section& root, const std::string& file) {
  if (auto* raster = root.findSection("RasterInfo")) raster->setField("SOFTWARE").setString(tesv_program_name());
  std::string text = tesv_description_text(root);
  for (const auto& name : tesv_text_section_names(file)) {
    const auto* own = root.findSection(name);
    bool written = false;
    if (own)
      for (const auto& f : own->fields) written = written || hasTextForm(f);
    if (written) continue;
    std::string other;
    if (flocal_readOtherSectionFromFile(file, name, other) == STATUS_OK) {
      text += other;
      if (!other.empty() && other.compare(other.size() - 2, 2, "\n\n") != 0) text += "\n";
    }
  }
  FilePtr out(std::fopen(file.c_str(), "wb"));
  if (!out) {
    ORV_REPORT("File not opened! " + file, REPORT_ERROR);
    return STATUS_NOT_OPENED;
  }
  bool ok = std::fwrite(text.data(), 1, text.size(), out.get()) == text.size();
  ok = std::fclose(out.release()) == 0 && ok;
  if (!ok) {
    ORV_REPORT("File writing failed! " + file, REPORT_ERROR);
    return STATUS_WRITE_FAILED;
  }
  return STATUS_OK;
}

int tesv_read_description_text(const std::string& file, tesv_description_section& root,
                               std::string* error) {
  FilePtr in(std::fopen(file.c_str(), "rb"));
  if (!in) {
    ORV_REPORT("File not opened! " + file, REPORT_ERROR);
    if (error) *error = "File not opened! " + file;
    return STATUS_NOT_OPENED;
  }
  tesv_description_section result("HEADER_INFO");
  tesv_description_section* current = &result;
  tesv_pool_buffer buffer;
  std::string line, problem;
  bool tooLong = false;
  long number = 0;
  while (nextLine(in.get(), buffer, line, tooLong)) {
    ++number;
    if (tooLong) {
      problem = "line longer than a pool buffer";
      break;
    }
    std::string t = trim(line);
    if (t.empty()) continue;
    std::string section = sectionOfLine(t);
    if (!section.empty()) {
      current = &result.openSection(section);
      continue;
    }
    auto eq = t.find('=');
    std::string name = eq == std::string::npos ? std::string() : trim(t.substr(0, eq));
    if (name.empty()) {
      problem = "not a field line";
      break;
    }
    std::vector<Token> tokens;
    tesv_description_field f(name);
    if (!tokenize(t.substr(eq + 1), tokens, problem) || !fieldFromTokens(tokens, f, problem)) break;
    auto& target = current->setField(name);
    bool mandatory = target.mandatory;
    target = std::move(f);
    target.mandatory = mandatory;
  }
  if (!problem.empty()) {
    std::string message = "File reading failed! " + file + " line " + std::to_string(number) + ": " + problem;
    ORV_REPORT(message, REPORT_ERROR);
    if (error) *error = message;
    return STATUS_READ_FAILED;
  }
  root = std::move(result);
  return STATUS_OK;
}
