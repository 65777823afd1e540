// Range focusing of a raw file in several passes (each pass written while
// the next one is compressed): the product does not depend on the pass
// size, and read and write failures keep their statuses.
#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "base/status.h"
#include "core/range_focus.h"
#include "synthetic_raw.h"

namespace {

using namespace synthetic_raw;

std::string bytesOf(const std::string& path) {
  std::ifstream f(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(f), std::istreambuf_iterator<char>()};
}

class RangeFocPasses : public ::testing::Test {
 protected:
  void SetUp() override {
    dir_ = std::filesystem::path(testing::TempDir()) /
           ("rangefoc_passes_" +
            std::string(::testing::UnitTest::GetInstance()->current_test_info()->name()));
    std::filesystem::create_directories(dir_);
  }
  void TearDown() override { std::filesystem::remove_all(dir_); }
  std::string path(const std::string& name) const { return (dir_ / name).string(); }
  std::filesystem::path dir_;
};

}  // namespace

TEST_F(RangeFocPasses, ProductIsTheSameWhateverThePassSize) {
  const Scene sc = makeScene();
  sc.write(path("raw"));
  const auto replica = sc.pulse.replica();
  std::string reference;
  for (int perBlock : {1000, 1, 3, 8, 39}) {
    SCOPED_TRACE(perBlock);
    RangeFocWork w;
    w.replica = replica.data();
    w.replicaLen = static_cast<int>(replica.size());
    w.linesPerBlock = perBlock;
    const std::string out = path("out" + std::to_string(perBlock));
    ASSERT_EQ(rangefoc(sc.params(path("raw"), out), w), 0);
    EXPECT_TRUE(w.data.empty());
    const std::string bytes = bytesOf(out);
    ASSERT_EQ(bytes.size(), sizeof(fcomplex) * w.outSamples * sc.lines);
    if (reference.empty())
      reference = bytes;
    else
      EXPECT_TRUE(bytes == reference) << "product differs from the one-pass product";
  }
}

TEST_F(RangeFocPasses, FailuresAfterEarlierPasses) {
  const Scene sc = makeScene();
  sc.write(path("raw"));
  const auto replica = sc.pulse.replica();
  RangeFocWork w;
  w.replica = replica.data();
  w.replicaLen = static_cast<int>(replica.size());
  w.linesPerBlock = 8;

  // The raw file ends inside the sixth pass: read failure, and the five
  // passes before it are in the product.
  auto p = sc.params(path("raw"), path("short"));
  p.lines = sc.lines + 1;
  EXPECT_EQ(rangefoc(p, w), STATUS_READ_FAILED);
  EXPECT_EQ(std::filesystem::file_size(path("short")),
            sizeof(fcomplex) * static_cast<std::size_t>(w.outSamples) * sc.lines);

  // A device that takes nothing: write failure, whatever the pass.
  if (std::filesystem::exists("/dev/full")) {
    for (int perBlock : {1, 8, 1000}) {
      w.linesPerBlock = perBlock;
      EXPECT_EQ(rangefoc(sc.params(path("raw"), "/dev/full"), w), STATUS_WRITE_FAILED) << perBlock;
    }
  }
}
