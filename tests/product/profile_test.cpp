// Profile files: parser consequences, writer layout, number formats, cache
// maintenance and the checked twins, pinned with exact file texts.
#include "product/profile.h"

#include <gtest/gtest.h>

#include "support/files.h"
#include <unistd.h>

#include <cstdint>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;

class ProfileTest : public support::ScratchFolderTest {
 protected:
  void SetUp() override { FreeProfile(); }
  void TearDown() override { FreeProfile(); }
  static std::string get(const std::string& s, const std::string& k, const std::string& f) {
    std::string v;
    return GetMyProfileString(s, k, v, f) == 0 ? v : std::string("<absent>");
  }
};

TEST_F(ProfileTest, ParserConsequences) {
  const std::string f = make("p.hdr",
                             "junk before the first section = 1\n"
                             "[Sec]   rest of the line is ignored\n"
                             "key1=value1\n"
                             "  key2   =    value2  \n"
                             "key3 = a = b [c]\n"
                             "; note = x\n"
                             "\tkey4\t = \tv\t\n"
                             "= skipped line\n"
                             "a\n"
                             "\n"
                             "b = 1\n"
                             "dup = first\n"
                             "dup = second\n"
                             "\n"
                             "[Sec]\n"
                             "key1 = later\n"
                             "only2 = z\n"
                             "ke[New]tail\n"
                             "z = 3\n"
                             "lost\n"
                             "[ Spaced ]\n"
                             "q = {\"s\" 2}\n"
                             "nokey\n"
                             "last = no newline");
  EXPECT_EQ(get("Sec", "key1", f), "later");  // later block found first
  EXPECT_EQ(get("Sec", "key2", f), "value2");  // falls through to the earlier block
  EXPECT_EQ(get("Sec", "key3", f), "a = b [c]");
  EXPECT_EQ(get("Sec", "; note", f), "x");  // no comment syntax
  EXPECT_EQ(get("Sec", "\tkey4\t", f), "\tv\t");  // tabs are kept
  EXPECT_EQ(get("Sec", "a\n\nb", f), "1");  // a newline does not end a key
  EXPECT_EQ(get("Sec", "dup", f), "second");
  EXPECT_EQ(get("Sec", "only2", f), "z");
  EXPECT_EQ(get("New", "z", f), "3");  // '[' inside a key opens a section
  EXPECT_EQ(get("Spaced", "q", f), "{\"s\" 2}");  // name trimmed, value not unquoted
  EXPECT_EQ(get("Spaced", "nokey\nlast", f), "no newline");  // key without '=' joins the next
  EXPECT_EQ(get("Sec", "junk before the first section", f), "<absent>");
  EXPECT_EQ(get("Sec", "= skipped line", f), "<absent>");
  EXPECT_EQ(get("Nope", "key1", f), "<absent>");

  // A write lands in the later block, also for a key that only the earlier
  // block holds; both blocks are written out again in their order.
  ASSERT_EQ(WriteMyProfileString("Sec", "new", "5", f), 0);
  ASSERT_EQ(WriteMyProfileString("Sec", "key2", "changed", f), 0);
  ASSERT_EQ(WriteMyProfileString("Fresh", "k", "v", f), 0);
  EXPECT_EQ(get("Sec", "key2", f), "changed");
  EXPECT_EQ(SyncProfile(f), 0);
  EXPECT_EQ(slurp(f),
            "\n[Sec]\n"
            "key1 = value1\n"
            "key2 = value2\n"
            "key3 = a = b [c]\n"
            "; note = x\n"
            "\tkey4\t = \tv\t\n"
            "a\n\nb = 1\n"
            "dup = first\n"
            "dup = second\n"
            "\n[Sec]\n"
            "key1 = later\n"
            "only2 = z\n"
            "new = 5\n"
            "key2 = changed\n"
            "\n[New]\n"
            "z = 3\n"
            "\n[Spaced]\n"
            "q = {\"s\" 2}\n"
            "nokey\nlast = no newline\n"
            "\n[Fresh]\n"
            "k = v\n");

  // The written file reads back to the same tree.
  FreeProfile(f);
  EXPECT_EQ(get("Sec", "new", f), "5");
  EXPECT_EQ(get("Sec", "a\n\nb", f), "1");
  EXPECT_EQ(get("Fresh", "k", f), "v");
}

TEST_F(ProfileTest, KeyFormsAndUnterminatedSection) {
  const std::string f = make("forms.hdr",
                             "[S]\nk1=v\nk2 = v\n  k3   =    v  \n= v\n[Cut");
  EXPECT_EQ(get("S", "k1", f), "v");
  EXPECT_EQ(get("S", "k2", f), "v");
  EXPECT_EQ(get("S", "k3", f), "v");
  EXPECT_EQ(get("S", "", f), "<absent>");
  EXPECT_EQ(get("Cut", "x", f), "<absent>");
  // Paths are compared byte for byte: the same file under another spelling
  // is a second cache entry.
  const std::string other = dir / "./forms.hdr";
  ASSERT_EQ(WriteMyProfileString("S", "k1", "changed", f), 0);
  EXPECT_EQ(get("S", "k1", other), "v");
}

TEST_F(ProfileTest, WriterNumberFormats) {
  const std::string f = path("w.hdr");
  const int ia[] = {1, -2, 3};
  const int64_t la[] = {9007199254740993LL, -1};
  const long lo[] = {2147483648L, 7};
  const float fa[] = {1.5f, 0.1f, 3.0f, 1.0f / 3.0f};
  const double da[] = {0.1, 2.5, -3.0, 1.0 / 3.0, 1e-20};
  const std::vector<std::string> sa = {"a", "b c", ""};
  EXPECT_EQ(WriteMyProfileInt("N", "int", -42, f), 0);
  EXPECT_EQ(WriteMyProfileInt64("N", "int64", 9007199254740993LL, f), 0);
  EXPECT_EQ(WriteMyProfileDouble("N", "double", 1.0 / 3.0, f), 0);
  EXPECT_EQ(WriteMyProfileDouble("N", "round", 6378137.0, f), 0);
  EXPECT_EQ(WriteMyProfileIntArray("A", "int", ia, 3, f), 0);
  EXPECT_EQ(WriteMyProfileInt64Array("A", "int64", la, 2, f), 0);
  EXPECT_EQ(WriteMyProfileLongArray("A", "long", lo, 2, f), 0);
  EXPECT_EQ(WriteMyProfileFloatArray("A", "float", fa, 4, f), 0);
  EXPECT_EQ(WriteProfileDoubleArray("A", "double", da, 5, f), 0);
  EXPECT_EQ(WriteMyProfileIntArray("A", "empty", std::vector<int>{}, f), 0);
  EXPECT_EQ(WriteMyProfileStringArray("A", "strings", sa, f), 0);
  EXPECT_EQ(WriteMyProfileString("M", "after", "1", f), 0);
  EXPECT_EQ(SyncProfile(f), 0);
  EXPECT_EQ(slurp(f),
            "\n[N]\n"
            "int = -42\n"
            "int64 = 9007199254740993\n"
            "double = 0.333333333333333\n"
            "round = 6378137\n"
            "\n[A]\n"
            "int = {1 -2 3}\n"
            "int64 = {9007199254740993 -1}\n"
            "long = {2147483648 7}\n"
            "float = {1.5 0.1 3 0.3333333}\n"
            "double = {0.1 2.5 -3 0.333333333333333 1e-20}\n"
            "empty = {}\n"
            "strings = {\"a\" \"b c\" \"\"}\n"
            "\n[M]\n"
            "after = 1\n");
  // Read back from disk.
  FreeProfile();
  EXPECT_EQ(get("M", "after", f), "1");
  int64_t big = 0;
  EXPECT_EQ(GetMyProfileInt64Array("N", "int64", &big, 1, f), 0);
  EXPECT_EQ(big, 9007199254740993LL);
  double third = 0;
  EXPECT_EQ(GetProfileDoubleArray("N", "double", &third, 1, f), 0);
  EXPECT_DOUBLE_EQ(third, 0.333333333333333);
  std::vector<long> lv;
  EXPECT_EQ(GetMyProfileLongArray("A", "long", lv, 2, f), 0);
  EXPECT_EQ(lv, (std::vector<long>{2147483648L, 7}));
}

TEST_F(ProfileTest, NumberReaders) {
  const std::string f = make("n.hdr",
                             "[S]\n"
                             "three = {1 2 3}\n"
                             "plain = 5\n"
                             "braced = {7}\n"
                             "empty = {}\n"
                             "bad = {1 x 3}\n"
                             "tabs = {4\t5  6}\n"
                             "blank =    \n"
                             "reals = {1.25 -2e3 0.1}\n"
                             "loose = 12abc 3\n");
  int v[4] = {-1, -1, -1, -1};
  EXPECT_EQ(GetMyProfileIntArray("S", "three", v, 2, f), 0);
  EXPECT_EQ(v[0], 1);
  EXPECT_EQ(v[1], 2);
  EXPECT_EQ(v[2], -1);
  // Too few values: the ones read stay, the report goes out and the result is 10.
  EXPECT_EQ(GetMyProfileIntArray("S", "three", v, 4, f), 10);
  EXPECT_EQ(v[2], 3);
  EXPECT_EQ(v[3], -1);
  int one = 0;
  EXPECT_EQ(GetMyProfileIntArray("S", "plain", &one, 1, f), 0);
  EXPECT_EQ(one, 5);
  EXPECT_EQ(GetMyProfileIntArray("S", "braced", &one, 1, f), 0);
  EXPECT_EQ(one, 7);
  EXPECT_EQ(GetMyProfileIntArray("S", "empty", &one, 1, f), 10);
  EXPECT_EQ(one, 7);
  int b[3] = {0, 0, 0};
  EXPECT_EQ(GetMyProfileIntArray("S", "bad", b, 3, f), 10);
  EXPECT_EQ(b[0], 1);
  EXPECT_EQ(b[1], 0);
  std::vector<int> t;
  EXPECT_EQ(GetMyProfileIntArray("S", "tabs", t, 3, f), 0);
  EXPECT_EQ(t, (std::vector<int>{4, 5, 6}));
  EXPECT_EQ(GetMyProfileIntArray("S", "blank", &one, 1, f), 10);
  EXPECT_EQ(GetMyProfileIntArray("S", "missing", &one, 1, f), 10);
  EXPECT_EQ(GetMyProfileIntArray("S", "three", &one, 0, f), 0);
  std::vector<float> fl;
  EXPECT_EQ(GetMyProfileFloatArray("S", "reals", fl, 3, f), 0);
  EXPECT_FLOAT_EQ(fl[0], 1.25f);
  EXPECT_FLOAT_EQ(fl[1], -2000.0f);
  EXPECT_FLOAT_EQ(fl[2], 0.1f);
  std::vector<double> dv;
  EXPECT_EQ(GetMyProfileDoubleArray("S", "reals", dv, 3, f), 0);
  EXPECT_DOUBLE_EQ(dv[2], 0.1);
  int lo[2] = {0, 0};
  EXPECT_EQ(GetMyProfileIntArray("S", "loose", lo, 2, f), 0);  // "%d" stops at the letters
  EXPECT_EQ(lo[0], 12);
  EXPECT_EQ(lo[1], 3);
  EXPECT_EQ(GetMyProfileIntArray("S", "three", v, 1, path("missing.hdr")), 10);
}

TEST_F(ProfileTest, StringReaders) {
  const std::string longText(5000, 'x');
  const std::string f = make("s.hdr",
                             "[S]\n"
                             "three = {\"a\" \"b c\" \"\"}\n"
                             "empty = {}\n"
                             "plain = abc\n"
                             "other = {\"a\" x \"b\"}\n"
                             "open = {\"a\" \"b\n"
                             "short = {\"a\"\n"
                             "long = {\"" + longText + "\" \"y\"}\n");
  std::vector<std::string> s;
  EXPECT_EQ(GetMyProfileStringArray("S", "three", s, 3, 512, f), 0);
  EXPECT_EQ(s, (std::vector<std::string>{"a", "b c", ""}));
  s.assign(2, "keep");
  EXPECT_EQ(GetMyProfileStringArray("S", "three", s, 2, 512, f), 0);
  EXPECT_EQ(s, (std::vector<std::string>{"a", "b c"}));
  s.assign(5, "keep");
  EXPECT_EQ(GetMyProfileStringArray("S", "three", s, 5, 512, f), 3);  // a count, not a status
  EXPECT_EQ(s[2], "");
  EXPECT_EQ(s[3], "keep");
  EXPECT_EQ(GetMyProfileStringArray("S", "empty", s, 2, 512, f), 0);
  s.assign(1, "keep");
  EXPECT_EQ(GetMyProfileStringArray("S", "plain", s, 1, 512, f), 0);
  EXPECT_EQ(s[0], "keep");
  s.assign(3, "");
  EXPECT_EQ(GetMyProfileStringArray("S", "other", s, 3, 512, f), 0);
  EXPECT_EQ(s[0], "a");
  EXPECT_EQ(s[1], "");
  EXPECT_EQ(GetMyProfileStringArray("S", "open", s, 3, 512, f), 10);
  EXPECT_EQ(GetMyProfileStringArray("S", "short", s, 2, 512, f), 10);
  EXPECT_EQ(GetMyProfileStringArray("S", "missing", s, 2, 512, f), 10);
  std::string arr[2];
  EXPECT_EQ(GetMyProfileStringArray("S", "long", arr, 2, 512, f), 0);
  EXPECT_EQ(arr[0], longText);
  EXPECT_EQ(arr[1], "y");

  // Buffer form cuts at size - 1.
  char buf[4] = {'z', 'z', 'z', 'z'};
  EXPECT_EQ(GetMyProfileString("S", "plain", buf, 3, f), 0);
  EXPECT_STREQ(buf, "ab");
  EXPECT_EQ(GetMyProfileString("S", "missing", buf, 3, f), 10);
}

TEST_F(ProfileTest, LargeValuesAndFiles) {
  const std::string f = path("big.hdr");
  std::vector<double> many(20000);
  for (size_t i = 0; i < many.size(); ++i) many[i] = double(i) * 0.5 - 7.25;
  const std::string longValue(300000, 'q');
  ASSERT_EQ(WriteProfileDoubleArray("B", "many", many, f), 0);
  ASSERT_EQ(WriteMyProfileString("B", "long", longValue, f), 0);
  for (int s = 0; s < 300; ++s)
    ASSERT_EQ(WriteMyProfileInt("Sec" + std::to_string(s), "k", s, f), 0);
  ASSERT_EQ(SyncProfile(f), 0);
  FreeProfile();
  std::vector<double> back;
  ASSERT_EQ(GetProfileDoubleArray("B", "many", back, int(many.size()), f), 0);
  EXPECT_EQ(back, many);
  EXPECT_EQ(get("B", "long", f), longValue);
  int k = 0;
  EXPECT_EQ(GetMyProfileIntArray("Sec299", "k", &k, 1, f), 0);
  EXPECT_EQ(k, 299);
}

// A checked call that fails throws the "Error in ..." text the job driver
// prints before the run ends with status 1; no process exit in the library.
TEST_F(ProfileTest, CheckedCallFailureIsAnError) {
  const std::string f = path("checked.hdr");
  ASSERT_EQ(WriteMyProfileString("S", "k", "1", f), 0);
  std::string value;
  EXPECT_EQ(GetCheckMyProfileString("S", "k", value, f), 0);
  try {
    GetCheckMyProfileString("S", "absent", value, f);
    FAIL() << "no error";
  } catch (const ProfileCheckError& e) {
    EXPECT_EQ(std::string(e.what()),
              "Error in GetMyProfileString: section S, key absent, file " + f + "\n");
  }
}

}  // namespace
