// SPDX-License-Identifier: Apache-2.0
// Tests with a folder of their own.
#pragma once

#include <gtest/gtest.h>

#include "tests/support/temporary_folder.h"

namespace vexa_test {

class InTemporaryFolder : public testing::Test {
 protected:
  const TemporaryFolder folder_;
};

}  // namespace vexa_test
