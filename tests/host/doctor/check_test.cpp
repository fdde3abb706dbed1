// SPDX-License-Identifier: Apache-2.0
#include "host/doctor/check.h"

#include <gtest/gtest.h>

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

Check check_with(std::vector<std::pair<std::string, Json>> evidence) {
  Check check;
  check.name = "system";
  check.verdict = Verdict::kWorks;
  check.evidence = std::move(evidence);
  return check;
}

Json evidence_of(std::vector<std::pair<std::string, Json>> evidence) {
  return report_of({check_with(std::move(evidence))}, "1.0",
                   Redactor(Credentials{"op", "tr0ub4dor"}))["checks"][0]["evidence"];
}

TEST(DoctorReport, HoldsEvidenceThatIsOnTheListAndNoOther) {
  EXPECT_EQ(evidence_of({{"model", "VX-2000"}, {"serialNumber", "100001"}, {"address", "192.0.2.1"}}),
            Json({{"model", "VX-2000"}}));
  for (const char* field :
       {"address", "host", "user", "password", "serialNumber", "macAddress", "text", "answer", ""}) {
    EXPECT_FALSE(may_be_reported(field)) << field;
  }
}

TEST(DoctorReport, HidesThePasswordInACamerasTexts) {
  EXPECT_EQ(evidence_of({{"model", "VX tr0ub4dor"}}), Json({{"model", "VX ***"}}));
  EXPECT_EQ(evidence_of({{"model", Json::array({"b3A6dHIwdWI0ZG9y"})}}), Json({{"model", Json::array({"***"})}}));
}

TEST(DoctorReport, ShowsACamerasTextsInOneLineAndNotEndlessly) {
  EXPECT_EQ(evidence_of({{"model", "a\nb\x1b[2J"}}), Json({{"model", "a\\x0ab\\x1b[2J"}}));
  EXPECT_EQ(evidence_of({{"software", std::string(5000, 'x')}})["software"].get<std::string>().size(), 160U);
}

TEST(DoctorReport, AsTextHasALineForEachCheckAndTheRemedyBelow) {
  Check failed;
  failed.name = "http port";
  failed.verdict = Verdict::kFails;
  failed.evidence = {{"port", 80}, {"error", "Connection refused"}};
  failed.remedy = "Check the port.";
  const Json report = report_of({check_with({{"jitterMilliseconds", 1.5}, {"keyPicture", true}}), failed}, "1.0", {});
  EXPECT_EQ(text_of_report(report),
            "Driver version 1.0\n"
            "system                   works          jitter milliseconds 1.5, key picture yes\n"
            "http port                does not work  port 80, error Connection refused\n"
            "    Check the port.\n");
}

TEST(DoctorOutcome, IsThatOfTheFirstCheckThatFails) {
  std::vector<Check> checks(3);
  checks[0].verdict = Verdict::kWorks;
  EXPECT_EQ(outcome_of(checks), ExitCode::kOk);
  checks[1].verdict = Verdict::kFails;
  checks[1].code = ExitCode::kUnauthorized;
  checks[2].verdict = Verdict::kFails;
  checks[2].code = ExitCode::kNoVideo;
  EXPECT_EQ(outcome_of(checks), ExitCode::kUnauthorized);
}

TEST(DoctorOutcome, APartThatIsNotThereIsNoFailure) {
  std::vector<Check> checks(3);
  checks[0].verdict = Verdict::kLacking;
  checks[1].verdict = Verdict::kPartly;
  checks[2].verdict = Verdict::kUntried;
  EXPECT_EQ(outcome_of(checks), ExitCode::kOk);
}

}  // namespace
}  // namespace vexa::host
