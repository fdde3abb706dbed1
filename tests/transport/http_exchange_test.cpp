// Every exchange of tests/data/exchanges/http, byte for byte.
#include "tests/support/exchange_run.h"

namespace vexa_test {
namespace {

class HttpExchange : public ExchangeTest {
 protected:
  HttpExchange() : ExchangeTest("http") {}
};

TEST_P(HttpExchange, GoesAsWritten) {
  ScriptedCamera camera(script());
  driver_.use(camera.host(), camera.port(), std::stoi(before("timeout", "20000")));
  const std::string call = before("call", "");
  const std::string argument = call.substr(call.find(' ') + 1);
  std::string answer = "untouched";
  const bool inquires = call.starts_with("inquire ");
  ASSERT_TRUE(inquires || call.starts_with("command ")) << "no such call: " << call;
  const ELibDReturnCode result =
      inquires ? driver_.SendInqCommand(argument, answer) : driver_.camera().send("%s", argument.c_str());
  EXPECT_EQ(camera.finish(), "");
  expect_result("result", std::to_string(result));
  expect_result("answer", answer);
  expect_latest_error();
  expect_nothing_left_open();
}

INSTANTIATE_TEST_SUITE_P(Files, HttpExchange, testing::ValuesIn(exchange_names(VEXA_TEST_DATA "/exchanges/http")),
                         name_of_exchange);

}  // namespace
}  // namespace vexa_test
