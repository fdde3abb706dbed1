// One exchange file played against one driver.
#pragma once

#include <gtest/gtest.h>

#include <string>

#include "tests/support/exchange_file.h"
#include "tests/support/process_state.h"
#include "tests/support/test_driver.h"

namespace vexa_test {

/// A test of every file in a folder of tests/data/exchanges. The driver's latest error is soiled before.
class ExchangeTest : public testing::TestWithParam<std::string> {
 protected:
  explicit ExchangeTest(const std::string& folder)
      : file_(read_exchange(std::string(VEXA_TEST_DATA "/exchanges/") + folder + "/" + GetParam() + ".txt")) {
    driver_.soil_latest_error();
    descriptors_ = open_descriptors();
  }

  std::string before(const std::string& key, const std::string& otherwise) const {
    const auto found = file_.before.find(key);
    return found == file_.before.end() ? otherwise : found->second;
  }

  void expect_result(const std::string& key, const std::string& actual) const {
    const auto expected = file_.results.find(key);
    if (expected == file_.results.end()) return;
    EXPECT_EQ(actual, expected->second) << key;
  }

  void expect_latest_error() {
    expect_result("code", std::to_string(driver_.LatestErrorCode()));
    expect_result("text", driver_.LatestErrorText());
  }

  void expect_nothing_left_open() const { EXPECT_EQ(open_descriptors(), descriptors_); }

  ExchangeFile file_;
  TestDriver driver_;

 private:
  std::size_t descriptors_ = 0;
};

inline std::string name_of_exchange(const testing::TestParamInfo<std::string>& info) { return info.param; }

}  // namespace vexa_test
