// Description headers: section tree, XML and text spellings, parser errors,
// work pool.
#include <gtest/gtest.h>

#include <cmath>
#include <string>
#include <vector>

#include "base/status.h"
#include "diag/orvane_exception.h"
#include "output/description_section.h"
#include "output/description_text.h"
#include "output/description_xml.h"
#include "output/work_pool.h"
#include "output_test_util.h"

using namespace output_test;

namespace {

const std::string kSpecial = "a&b<c>d\"e'f";

// A tree with every shape and type, special characters, NaN and empty values.
tesv_description_section sampleTree() {
  tesv_description_section root = makeProductHeader();
  auto& raster = *root.findSection("RasterInfo");
  raster.setField("NrOfPixelsPerLine").setInt(4900);
  raster.setField("Text").setString(kSpecial);
  raster.setField("Spaced").setString("INCREASE TIME DIRECTION");
  raster.setField("Empty").setString("");
  raster.setField("NaNValue").setDouble(std::nan(""));
  raster.setField("Small").setDouble(1.0e-7);
  raster.setField("Third").setDouble(1.0 / 3.0);
  raster.setField("Unset").setEmpty(FT_DOUBLE);
  raster.setMandatory("NrOfPixelsPerLine", true);
  auto& sensor = root.openSection("Sensor");
  sensor.setField("Vector").setDoubleVector({1.5, -2.25, std::nan(""), 3e20});
  sensor.setField("Ints").setIntVector({-1, 0, 9000000000LL});
  sensor.setField("Names").setStringVector({"x y", "", kSpecial});
  sensor.setField("Matrix").setDoubleMatrix(2, 3, {1, 2, 3, 4, 5, 6.5});
  sensor.setField("NoRows").setDoubleMatrix(0, 7, {});
  tesv_description_section inner("Inner");
  inner.setField("Depth").setInt(2);
  sensor.setField("One").setSections({inner}, false);
  sensor.setField("Many").setSections({inner, tesv_description_section("Second")}, true);
  tesv_description_field a("A"), b("B");
  a.setInt(1);
  b.setString("two");
  sensor.setField("Pair").setMultiple({a, b});
  root.openSection("UnknownToUs").setField("Kept").setString("yes");
  return root;
}

}  // namespace

TEST(DescriptionXml, WrittenLayoutAndRoundTrip) {
  const std::string dir = support::scratchDir("output");
  const std::string file = dir + "tree.sml";
  tesv_description_section tree = sampleTree();
  ASSERT_EQ(tesv_write_description_xml(tree, file), 0);
  const std::string text = readText(file);
  const std::string ns = kHeaderSchemaNamespace;
  EXPECT_EQ(text.rfind("<?xml version=\"1.0\" ?>\n<HEADER_INFO\n\txmlns=\"" + ns +
                           "\"\n\txmlns:xsi=\"http://www.w3.org/2001/XMLSchema-instance\"\n"
                           "\txsi:schemaLocation=\"" + ns + "\n\t" + ns +
                           "/TessivorHeaderSchema_version_1.0.xsd\">\n",
                       0),
            0u)
      << text.substr(0, 400);
  EXPECT_NE(text.find("<FIELD NAME = \"NrOfPixelsPerLine\" MANDATORY = \"1\">"), std::string::npos);
  EXPECT_NE(text.find("<Value>a&amp;b&lt;c&gt;d&quot;e&apos;f</Value>"), std::string::npos);
  EXPECT_NE(text.find("<Value>NaN</Value>"), std::string::npos);
  EXPECT_NE(text.find("<Value>IS_EMPTY</Value>"), std::string::npos);
  EXPECT_NE(text.find("<Matrix ROWS = \"2\" COLUMNS = \"3\">"), std::string::npos);
  // The SOFTWARE field names the running program.
  EXPECT_EQ(tree.getField("RasterInfo.SOFTWARE")->strings.at(0), tesv_program_name());
  // Empty sections are left out of the document.
  EXPECT_EQ(text.find("<NAME>Baseline</NAME>"), std::string::npos);

  tesv_description_section back;
  std::string error;
  ASSERT_EQ(tesv_read_description_xml(file, back, "HEADER_INFO", &error), 0) << error;
  EXPECT_EQ(back.name, "HEADER_INFO");
  EXPECT_EQ(back.getField("RasterInfo.NrOfPixelsPerLine")->ints, std::vector<long long>{4900});
  EXPECT_TRUE(back.getField("RasterInfo.NrOfPixelsPerLine")->mandatory);
  EXPECT_FALSE(back.getField("RasterInfo.Text")->mandatory);
  EXPECT_EQ(back.getField("RasterInfo.Text")->strings.at(0), kSpecial);
  EXPECT_EQ(back.getField("RasterInfo.Spaced")->strings.at(0), "INCREASE TIME DIRECTION");
  std::string empty = "x";
  EXPECT_EQ(back.getField("RasterInfo.Empty")->getString(empty), 0);
  EXPECT_EQ(empty, "");
  EXPECT_TRUE(std::isnan(back.getField("RasterInfo.NaNValue")->doubles.at(0)));
  EXPECT_EQ(back.getField("RasterInfo.Small")->doubles.at(0), 1.0e-7);
  EXPECT_EQ(back.getField("RasterInfo.Third")->doubles.at(0), 1.0 / 3.0);
  EXPECT_TRUE(back.getField("RasterInfo.Unset")->isEmpty());
  EXPECT_EQ(back.getField("RasterInfo.Unset")->type, FT_DOUBLE);

  const auto* vec = back.getField("Sensor.Vector");
  ASSERT_EQ(vec->shape, FS_VECTOR);
  ASSERT_EQ(vec->doubles.size(), 4u);
  EXPECT_EQ(vec->doubles[1], -2.25);
  EXPECT_TRUE(std::isnan(vec->doubles[2]));
  EXPECT_EQ(vec->doubles[3], 3e20);
  EXPECT_EQ(back.getField("Sensor.Ints")->ints, (std::vector<long long>{-1, 0, 9000000000LL}));
  EXPECT_EQ(back.getField("Sensor.Names")->strings, (std::vector<std::string>{"x y", "", kSpecial}));
  const auto* m = back.getField("Sensor.Matrix");
  EXPECT_EQ(m->shape, FS_MATRIX);
  EXPECT_EQ(m->rows, 2);
  EXPECT_EQ(m->cols, 3);
  EXPECT_EQ(m->doubles, (std::vector<double>{1, 2, 3, 4, 5, 6.5}));
  EXPECT_EQ(back.getField("Sensor.NoRows")->rows, 0);
  const auto* one = back.getField("Sensor.One");
  ASSERT_EQ(one->type, FT_FIELD_OF_SECTION);
  EXPECT_EQ(one->shape, FS_SCALAR);
  ASSERT_EQ(one->sections.size(), 1u);
  EXPECT_EQ(one->sections[0].getField("Depth")->ints.at(0), 2);
  const auto* many = back.getField("Sensor.Many");
  EXPECT_EQ(many->shape, FS_VECTOR);
  ASSERT_EQ(many->sections.size(), 2u);
  EXPECT_EQ(many->sections[1].name, "Second");
  const auto* pair = back.getField("Sensor.Pair");
  ASSERT_EQ(pair->shape, FS_MULTIPLE);
  ASSERT_EQ(pair->subFields.size(), 2u);
  EXPECT_EQ(pair->subFields[1].strings.at(0), "two");
  EXPECT_EQ(back.getField("UnknownToUs.Kept")->strings.at(0), "yes");

  // The written document is valid against the shipped schema, and the
  // schema is strict enough to refuse a broken one.
  EXPECT_EQ(validateAgainstSchema(file), 0);
  std::string broken = text;
  broken.replace(broken.find("MANDATORY = \"1\""), 15, "MANDATORY = \"2\"");
  writeText(dir + "broken.sml", broken);
  EXPECT_GT(validateAgainstSchema(dir + "broken.sml"), 0);
  broken = text;
  broken.replace(broken.find("<Value>4900</Value>"), 19, "<Value>4.5</Value>");
  writeText(dir + "broken.sml", broken);
  EXPECT_GT(validateAgainstSchema(dir + "broken.sml"), 0);
}

TEST(DescriptionXml, MalformedDocumentsGiveParserErrors) {
  struct Case {
    const char* document;
    const char* message;
  } cases[] = {
      {"<?xml version=\"1.0\" ?>\n<HEADER_INFO><NumberOfElements>0</NumberOfElements>&</HEADER_INFO>",
       "not well-formed"},
      {"<?xml version=\"1.0\" ?>\n<HEADER_INFO><NumberOfElements>0</Number></HEADER_INFO>", "mismatched tag"},
      {"<?xml version=\"1.0\" ?>\n<HEADER_INFO><NumberOfElements>0</NumberOfElements>", "no element found"},
      {"<?xml version=\"1.0\" ?>\n<HEADER_INFO><NumberOf", "unclosed token"},
      {"", "no element found"},
  };
  for (const auto& c : cases) {
    tesv_description_section root("untouched");
    std::string error;
    EXPECT_EQ(tesv_parse_description_xml(c.document, root, "HEADER_INFO", &error), STATUS_READ_FAILED)
        << c.document;
    EXPECT_NE(error.find(c.message), std::string::npos) << error;
    EXPECT_NE(error.find("line"), std::string::npos) << error;
    EXPECT_EQ(root.name, "untouched");
  }

  // Well-formed but not what is expected.
  tesv_description_section root;
  std::string error;
  EXPECT_EQ(tesv_parse_description_xml("<OTHER/>", root, "HEADER_INFO", &error), STATUS_BAD_CONDITION);
  EXPECT_EQ(error, "NOT FOUND this->mInitialTag : HEADER_INFO");
  EXPECT_EQ(tesv_parse_description_xml(
                "<HEADER_INFO><NumberOfElements>2</NumberOfElements>"
                "<SECTION><NAME>A</NAME><NumberOfElements>0</NumberOfElements></SECTION></HEADER_INFO>",
                root, "HEADER_INFO", &error),
            STATUS_BAD_CONDITION);
  EXPECT_NE(error.find("announces 2"), std::string::npos) << error;
  EXPECT_EQ(tesv_parse_description_xml(
                "<HEADER_INFO><NumberOfElements>1</NumberOfElements><SECTION><NAME>A</NAME>"
                "<NumberOfElements>1</NumberOfElements><FIELD NAME = \"x\" MANDATORY = \"0\">"
                "<Integer><Value>1.5</Value></Integer></FIELD></SECTION></HEADER_INFO>",
                root, "HEADER_INFO", &error),
            STATUS_BAD_CONDITION);
  EXPECT_NE(error.find("bad integer [1.5]"), std::string::npos) << error;

  // Deep nesting is refused, not recursed into.
  std::string deep = "<HEADER_INFO>";
  for (int i = 0; i < 400; ++i) deep += "<SECTION>";
  EXPECT_EQ(tesv_parse_description_xml(deep, root, "HEADER_INFO", &error), STATUS_READ_FAILED);
  EXPECT_NE(error.find("nested too deeply"), std::string::npos) << error;

  EXPECT_EQ(tesv_read_description_xml("/nonexistent/dir/x.sml", root, "HEADER_INFO", &error),
            STATUS_NOT_OPENED);
}

TEST(DescriptionText, LayoutRoundTripAndKeptSections) {
  const std::string dir = support::scratchDir("output");
  const std::string file = dir + "tree_hdr";
  tesv_description_section tree = sampleTree();
  ASSERT_EQ(tesv_write_description_text(tree, file), 0);
  const std::string text = readText(file);
  EXPECT_NE(text.find("[RasterInfo]\nNrOfPixelsPerLine = 4900\n"), std::string::npos) << text;
  EXPECT_NE(text.find("Text = \"a&amp;b&lt;c&gt;d&quot;e&apos;f\"\n"), std::string::npos);
  EXPECT_NE(text.find("NaNValue = NaN\n"), std::string::npos);
  EXPECT_NE(text.find("Unset = IS_EMPTY\n"), std::string::npos);
  EXPECT_NE(text.find("Vector = [ 1.5 -2.25 NaN 3e+20 ]\n"), std::string::npos);
  EXPECT_NE(text.find("Matrix = [ [ 1 2 3 ] [ 4 5 6.5 ] ]\n"), std::string::npos);
  EXPECT_EQ(text.find("Pair"), std::string::npos);  // no text form

  tesv_description_section back;
  std::string error;
  ASSERT_EQ(tesv_read_description_text(file, back, &error), 0) << error;
  EXPECT_EQ(back.getField("RasterInfo.NrOfPixelsPerLine")->ints.at(0), 4900);
  EXPECT_EQ(back.getField("RasterInfo.Text")->strings.at(0), kSpecial);
  EXPECT_EQ(back.getField("RasterInfo.Spaced")->strings.at(0), "INCREASE TIME DIRECTION");
  EXPECT_EQ(back.getField("RasterInfo.Empty")->strings.at(0), "");
  EXPECT_TRUE(std::isnan(back.getField("RasterInfo.NaNValue")->doubles.at(0)));
  EXPECT_EQ(back.getField("RasterInfo.Third")->doubles.at(0), 1.0 / 3.0);
  EXPECT_TRUE(back.getField("RasterInfo.Unset")->isEmpty());
  EXPECT_EQ(back.getField("Sensor.Ints")->ints, (std::vector<long long>{-1, 0, 9000000000LL}));
  EXPECT_EQ(back.getField("Sensor.Names")->strings, (std::vector<std::string>{"x y", "", kSpecial}));
  const auto* m = back.getField("Sensor.Matrix");
  EXPECT_EQ(m->rows, 2);
  EXPECT_EQ(m->cols, 3);
  EXPECT_EQ(m->doubles, (std::vector<double>{1, 2, 3, 4, 5, 6.5}));
  EXPECT_TRUE(std::isnan(back.getField("Sensor.Vector")->doubles.at(2)));

  // A section written by someone else survives our rewrite, as it stands.
  writeText(file, text + "[ForeignSection]\nOdd  =  [ 1\t2 ]\nName = Value\n");
  std::string copied;
  ASSERT_EQ(flocal_readOtherSectionFromFile(file, "ForeignSection", copied), 0);
  EXPECT_EQ(copied, "[ForeignSection]\nOdd  =  [ 1\t2 ]\nName = Value\n");
  EXPECT_EQ(flocal_readOtherSectionFromFile(file, "Missing", copied), STATUS_BAD_CONDITION);
  tesv_description_section fresh("HEADER_INFO");
  fresh.openSection("RasterInfo").setField("NrOfPixelsPerLine").setInt(12);
  ASSERT_EQ(tesv_write_description_text(fresh, file), 0);
  const std::string rewritten = readText(file);
  EXPECT_NE(rewritten.find("[ForeignSection]\nOdd  =  [ 1\t2 ]\nName = Value\n"), std::string::npos);
  EXPECT_NE(rewritten.find("[Sensor]\n"), std::string::npos);  // not in the new tree: kept
  EXPECT_NE(rewritten.find("NrOfPixelsPerLine = 12\n"), std::string::npos);
  EXPECT_EQ(rewritten.find("NrOfPixelsPerLine = 4900"), std::string::npos);
  ASSERT_EQ(tesv_read_description_text(file, back), 0);
  EXPECT_EQ(back.getField("ForeignSection.Odd")->ints, (std::vector<long long>{1, 2}));
  EXPECT_EQ(back.getField("ForeignSection.Name")->strings.at(0), "Value");

  // Broken lines are refused with the file and line named.
  const char* broken[] = {"[A]\nno equal sign\n", "[A]\nx = \"open\n", "[A]\nx = [ 1 2\n",
                          "[A]\nx = 1 2\n", "[A]\nx = [ [ 1 2 ] [ 3 ] ]\n", "[A]\n = 3\n"};
  for (const char* b : broken) {
    writeText(file, b);
    EXPECT_EQ(tesv_read_description_text(file, back, &error), STATUS_READ_FAILED) << b;
    EXPECT_NE(error.find(file + " line 2"), std::string::npos) << error;
  }
  EXPECT_EQ(tesv_read_description_text(dir + "absent_hdr", back), STATUS_NOT_OPENED);
  // A line that does not fit a pool buffer is refused, not cut.
  writeText(file, "[A]\nx = \"" + std::string(kWorkPoolBufferSize, 'y') + "\"\n");
  EXPECT_EQ(tesv_read_description_text(file, back, &error), STATUS_READ_FAILED);
  EXPECT_NE(error.find("longer than a pool buffer"), std::string::npos) << error;
  EXPECT_EQ(tesv_work_pool_busy(), 0);
}
