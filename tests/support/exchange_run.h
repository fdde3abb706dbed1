// SPDX-License-Identifier: Apache-2.0
// One exchange file played against one driver.
#pragma once

#include <gtest/gtest.h>

#include <map>
#include <set>
#include <string>

#include "tests/support/exchange_file.h"
#include "tests/support/process_state.h"
#include "tests/support/test_driver.h"

namespace vexa_test {

/// A test of every file in a folder of tests/data/exchanges. The driver's latest error is soiled before. A line of the
/// file that the test has not looked at fails it.
class ExchangeTest : public testing::TestWithParam<std::string> {
 protected:
  explicit ExchangeTest(const std::string& folder)
      : file_(read_exchange(std::string(VEXA_TEST_DATA "/exchanges/") + folder + "/" + GetParam() + ".txt")) {
    driver_.soil_latest_error();
    descriptors_ = open_descriptors();
  }

  void TearDown() override {
    for (const auto* entries : {&file_.before, &file_.results}) {
      for (const auto& [key, value] : *entries) EXPECT_TRUE(read_.contains(key)) << "nobody looks at: " << key;
    }
  }

  std::string before(const std::string& key, const std::string& otherwise) {
    read_.insert(key);
    const auto found = file_.before.find(key);
    return found == file_.before.end() ? otherwise : found->second;
  }

  /// Whether the file names `key` before the exchange.
  bool has(const std::string& key) {
    read_.insert(key);
    return file_.before.contains(key);
  }

  void expect_result(const std::string& key, const std::string& actual) {
    read_.insert(key);
    const auto expected = file_.results.find(key);
    if (expected == file_.results.end()) return;
    EXPECT_EQ(actual, expected->second) << key;
  }

  void expect_latest_error() {
    expect_result("code", std::to_string(driver_.LatestErrorCode()));
    expect_result("text", driver_.LatestErrorText());
  }

  void expect_nothing_left_open() const { EXPECT_EQ(open_descriptors(), descriptors_); }

  const Script& script() const { return file_.script; }

  TestDriver driver_;

 private:
  const ExchangeFile file_;
  std::set<std::string> read_;
  std::size_t descriptors_ = 0;
};

inline std::string name_of_exchange(const testing::TestParamInfo<std::string>& info) { return info.param; }

}  // namespace vexa_test
