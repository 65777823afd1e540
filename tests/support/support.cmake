# The test-support library: scratch folders, simulated scenes, the focuser run
# as a host runs it, point-target measurements. Linked by every test folder
# and by the benchmarks.
file(GLOB support_sources CONFIGURE_DEPENDS "${CMAKE_SOURCE_DIR}/tests/support/*.cpp")
add_library(tessivor_test_support STATIC ${support_sources})
target_link_libraries(tessivor_test_support PUBLIC tessivor_job tessivor_sim GTest::gtest)
target_include_directories(tessivor_test_support PUBLIC "${CMAKE_SOURCE_DIR}/tests")
target_compile_definitions(tessivor_test_support PUBLIC
  TESSIVOR_SOURCE_DIR="${CMAKE_SOURCE_DIR}"
  TESSIVOR_BINARY_DIR="${CMAKE_BINARY_DIR}"
  TESSIVOR_REALDATA_DIR="${CMAKE_SOURCE_DIR}/../shared/realdata")
