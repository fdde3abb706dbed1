// SPDX-License-Identifier: Apache-2.0
// One check of vexactl doctor, and the report that is made of all of them.
#ifndef HOST_DOCTOR_CHECK_H_
#define HOST_DOCTOR_CHECK_H_

#include <nlohmann/json.hpp>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "host/access/redactor.h"
#include "host/base/problem.h"

namespace vexa::host {

enum class Verdict {
  kWorks,
  kPartly,   // it works, and something about it does not
  kFails,    // it does not
  kLacking,  // the camera has no such part
  kUntried,  // what it needs does not work
};

// What a check has found. Its evidence is named values, so that a report holds only what is on the list of what
// may be made public.
struct Check {
  std::string name;  // of the product: "http port", "inquiry camera", "stream 1 by rtp"
  Verdict verdict = Verdict::kUntried;
  std::vector<std::pair<std::string, nlohmann::ordered_json>> evidence;
  std::string remedy;                      // of the product, a sentence; empty when there is nothing to do
  ExitCode code = ExitCode::kUnreachable;  // how a failure ends the program
  long milliseconds = 0;
};

[[nodiscard]] const char* name_of(Verdict verdict);

// Evidence under these names is in the report; any other is left out.
[[nodiscard]] bool may_be_reported(std::string_view field);

// The report as JSON, with the password and what stands for it hidden in every text.
[[nodiscard]] nlohmann::ordered_json report_of(const std::vector<Check>& checks, const std::string& driver_version,
                                               const Redactor& redactor);
// The same for people, a line each and its remedy below it.
[[nodiscard]] std::string text_of_report(const nlohmann::ordered_json& report);

// How the program ends: as the first check that fails; kOk when none does.
[[nodiscard]] ExitCode outcome_of(const std::vector<Check>& checks);

}  // namespace vexa::host

#endif  // HOST_DOCTOR_CHECK_H_
