#include <gtest/gtest.h>

#include "base/status.h"

TEST(Build, ErrorCodesComposeFromPrimaryAndSecondary) {
  EXPECT_EQ(errorCode(7, 2), EC_TOO_FEW_PARAMETERS);
  EXPECT_EQ(errorCode(20, 6), EC_FILE_IO);
}
