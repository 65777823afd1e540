#include <gtest/gtest.h>

#include <fstream>

#include "base/status.h"
#include "diag/environment.h"
#include "diag/error_catalog.h"
#include "diag/orvane_exception.h"
#include "diag/parameter_lines.h"
#include "diag/ckerr.h"
#include "diag/report.h"
#include "support/files.h"

using namespace support;
using DiagEnvironment = WorkingFolderTest;

class EnvironmentBeforeInit : public DiagEnvironment {
 protected:
  EnvironmentBeforeInit() { startReports_ = false; }
};
using Environment = DiagEnvironment;

TEST_F(EnvironmentBeforeInit, VariablesDefaultsAndExceptionsBeforeTheEnvironmentIsReady) {
  std::string value = "untouched";
  unsetenv("TESSIVOR_MAP_FILES_DIR");
  EXPECT_EQ(tesvGetEnv("TESSIVOR_MAP_FILES_DIR", value), -11);
  EXPECT_EQ(value, "untouched");
  EXPECT_EQ(tesvGetEnv("TESSIVOR_WORKING_DIR", value), 0);
  EXPECT_EQ(value, working_);

  unsetenv("TESSIVOR_CEOS_DES_FILES_DIR");
  unsetenv("TESSIVOR_WORKING_DIR");
  EXPECT_EQ(tesvEnvOrDefault("TESSIVOR_CEOS_DES_FILES_DIR"), TESSIVOR_DEFAULT_RESOURCE_DIR);
  EXPECT_EQ(tesvEnvOrDefault("TESSIVOR_XML_SCHEMA_DES_FILES_DIR"), TESSIVOR_DEFAULT_RESOURCE_DIR);
  EXPECT_EQ(tesvEnvOrDefault("TESSIVOR_WORKING_DIR"),
            std::filesystem::current_path().string() + "/");
  EXPECT_EQ(tesvEnvOrDefault("TESSIVOR_MAP_FILES_DIR"), "");

  EXPECT_FALSE(environmentReady());
  try {
    TESV_FATAL(EC_BAD_COMMAND, "early");
    FAIL() << "no exception";
  } catch (const orvaneException& e) {
    EXPECT_NE(e.getMessage().find("early"), std::string::npos);
    EXPECT_NE(e.getMessage().find("[EC : 456963]"), std::string::npos);
    EXPECT_NE(e.getFile().find("environment_test.cpp"), std::string::npos);
    EXPECT_GT(e.getLine(), 0);
  }
  std::string title, message;
  lookupErrorCode(EC_BAD_COMMAND, title, message);
  EXPECT_EQ(title, "AN ERROR OCCUR DURING Tessivor INIT");
  EXPECT_EQ(message, "AN ERROR OCCUR DURING Tessivor INIT  : [456963]");
}

TEST(ErrorCatalogue, ShippedCataloguesHoldEveryCodeOfTheProgram) {
  const int codes[] = {1,       130560,  261122,  261123,  326400,  456962,  456963,  848646,
                       1305601, 1305602, 1305603, 1305604, 1305605, 1305606, 1370881, 1370882,
                       1370883, 1370884};
  for (const char* name : {"tesv_errors_catalog.des", "tesv_warnings_catalog.des"}) {
    ErrorCatalogue catalogue;
    std::string problem;
    ASSERT_TRUE(catalogue.load(std::string(TESSIVOR_SOURCE_DIR "/resources/") + name, problem))
        << problem;
    for (int code : codes) {
      std::string title, message;
      catalogue.lookup(code, title, message);
      EXPECT_NE(title, "GENERIC ERROR WRONG CODE") << name << " " << code;
      EXPECT_FALSE(message.empty()) << name << " " << code;
    }
  }
  ErrorCatalogue errors;
  std::string problem;
  ASSERT_TRUE(errors.load(TESSIVOR_SOURCE_DIR "/resources/tesv_errors_catalog.des", problem));
  std::string title, message;
  errors.lookup(errorCode(7, 2), title, message);
  EXPECT_EQ(title, "JOB REQUEST ERROR");
  EXPECT_NE(message.find("25 lines"), std::string::npos);
  errors.lookup(errorCode(7, 9), title, message);
  EXPECT_EQ(title, "GENERIC ERROR WRONG CODE");
  EXPECT_EQ(message, "JOB REQUEST ERROR  :  456969 [7 : 9]");
  errors.lookup(errorCode(3, 1), title, message);
  EXPECT_EQ(title, "GENERIC ERROR WRONG CODE");
  EXPECT_EQ(message, "GENERIC ERROR WRONG CODE  :  195841 [PEC 3]");
}

TEST(ErrorCatalogue, LayoutAndItsFaults) {
  const std::string file = scratchDir("catalogue") + "catalogue.des";
  std::ofstream(file) << "2\n4, file\n7\nFILE\nJOB\nErrorCodeInfo_4\n1\nzero\nErrorCodeInfo_7\n"
                         "3\na\n\nc\n";
  ErrorCatalogue catalogue;
  std::string problem;
  ASSERT_TRUE(catalogue.load(file, problem)) << problem;
  ASSERT_EQ(catalogue.groups().size(), 2u);
  EXPECT_EQ(catalogue.groups()[0].key, "4");
  std::string title, message;
  catalogue.lookup(errorCode(7, 2), title, message);
  EXPECT_EQ(title, "JOB");
  EXPECT_EQ(message, "c");
  std::ofstream(file) << "2\n4\n7\nFILE\nJOB\nErrorCodeInfo_7\n1\nzero\n";
  EXPECT_FALSE(catalogue.load(file, problem));
  EXPECT_NE(problem.find("ErrorCodeInfo_4"), std::string::npos);
  EXPECT_FALSE(catalogue.loaded());
  std::filesystem::remove(file);
}

TEST_F(Environment, PhaseBannersAndSuccessfulClose) {
  setPhaseText(std::string("Range\nfocusing ") + std::string(100, 'x'));
  EXPECT_EQ(phaseText().size(), 80u);
  EXPECT_EQ(phaseText().substr(0, 17), " Range focusing x");
  setPhaseText("Azimuth");
  EXPECT_EQ(phaseText(), " Azimuth");

  logStart({"a", "b"}, "Title", "");
  const std::string separator(160, '-');
  std::string log = readText(path("Process.log"));
  EXPECT_EQ(log.rfind("\n\n\n" + separator + "\nSTART : Title  [  Azimuth ]\n", 0), 0u);
  EXPECT_NE(log.find(separator + "\n\n Parameter 0 (a)\n Parameter 1 (b)\n" + separator + "\n\n"),
            std::string::npos);
  EXPECT_EQ(readText(path("Process.trace")), log);

  finishRun(0, true, true);
  log = readText(path("Process.log"));
  EXPECT_NE(log.find("\n\nSUCCESSFUL\n\n"), std::string::npos);
  EXPECT_NE(log.find(separator + "\nEND :  Azimuth  -  "), std::string::npos);
  EXPECT_EQ(readText(path("Process.trace_save")), readText(path("Process.trace")));
  // Writes after the close go nowhere.
  logWrite("late\n");
  EXPECT_EQ(readText(path("Process.log")).find("late"), std::string::npos);
  // No dated copy of the trace for a successful run.
  for (const auto& entry : std::filesystem::directory_iterator(working_))
    EXPECT_EQ(entry.path().filename().string().rfind("Tessivor_", 0), std::string::npos);
}

TEST_F(Environment, TheLogIsAppendedAndThePreviousTraceKept) {
  traceWrite("first run %d\n", 1);
  logWrite("first log\n");
  resetEnvironment();
  initEnvironment();
  traceWrite("second run\n");
  logWrite("second log\n");
  EXPECT_EQ(readText(path("Process.trace_save")), "first run 1\n");
  EXPECT_EQ(readText(path("Process.trace")), "second run\n");
  EXPECT_EQ(readText(path("Process.log")), "first log\nsecond log\n");
  EXPECT_TRUE(tracingActive());

  resetEnvironment();
  unsetenv("TESSIVOR_TRACING");
  initEnvironment();
  EXPECT_FALSE(tracingActive());
  EXPECT_EQ(progressFilePath(), path("progress.txt"));
  EXPECT_EQ(workingDirectory(), working_);
}

TEST_F(Environment, FatalPathWritesErrorFileLogsAndDatedTrace) {
  setPhaseText("Extraction");
  EXPECT_EXIT(TESV_FATAL(EC_FILE_NOT_FOUND, "/data/missing.txt"),
              ::testing::ExitedWithCode(EC_FILE_NOT_FOUND & 0xFF), "ERROR 261122");
  const std::string error = readText(path("progress.txt_error"));
  EXPECT_EQ(error.rfind("FILE ACCESS ERROR\nFile not found.", 0), 0u);
  EXPECT_NE(error.find("\n/data/missing.txt\n [EC : 261122]\n"), std::string::npos);
  EXPECT_FALSE(fs::exists(path("progress.txt_tmp")));
  const std::string log = readText(path("Process.log"));
  EXPECT_NE(log.find("\n\n Extraction [ERROR ID : 261122]\n  File not found."), std::string::npos);
  EXPECT_NE(log.find("[FILE ACCESS ERROR]\n  /data/missing.txt \n\n"), std::string::npos);
  EXPECT_NE(log.find("ERROR :\n  File not found."), std::string::npos);
  const std::string trace = readText(path("Process.trace"));
  EXPECT_NE(trace.find("\nERROR : File not found."), std::string::npos);
  EXPECT_NE(trace.find("(/data/missing.txt) \n  Extraction   "), std::string::npos);
  int dated = 0;
  for (const auto& entry : std::filesystem::directory_iterator(working_)) {
    const std::string name = entry.path().filename().string();
    if (name.rfind("Tessivor_", 0) == 0 && name.size() > 10 &&
        name.substr(name.size() - 10) == "_trace.txt") {
      ++dated;
      EXPECT_EQ(readText(entry.path().string()), trace);
    }
  }
  EXPECT_EQ(dated, 1);
}

TEST_F(Environment, ErrorFileForARasterAndItsLimits) {
  writeErrorFile(EC_STAGE_FAILED, std::string(3000, 'd') + "\n" + std::string(40, 'e'),
                 path("raster").c_str());
  EXPECT_TRUE(fs::exists(path("raster_hdr")));
  EXPECT_TRUE(fs::exists(path("raster.sml")));
  const std::string error = readText(path("progress.txt_error"));
  std::string expected(1, '\n');
  expected.append(1023, 'd').append(1, '\n').append(40, 'e').append("\n [EC : 130560]\n");
  EXPECT_NE(error.find(expected), std::string::npos);
  std::string many;
  for (int i = 0; i < 100; ++i) many += "line " + std::to_string(i) + "\n";
  writeErrorFile(EC_STAGE_FAILED, many, nullptr);
  const std::string cut = readText(path("progress.txt_error"));
  EXPECT_NE(cut.find("line 28\n [EC : 130560]\n"), std::string::npos);
  EXPECT_EQ(cut.find("line 29"), std::string::npos);
  EXPECT_NE(readText(path("Process.trace")).find("(aTotLen + aLen) ["), std::string::npos);
}
