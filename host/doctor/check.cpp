// SPDX-License-Identifier: Apache-2.0
#include "host/doctor/check.h"

#include <fmt/format.h>

#include <algorithm>
#include <iterator>

#include "host/base/printable.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

constexpr std::size_t kLongestText = 160;

// Numbers, codes of the driver and the system, and words of the product. Of the camera's own texts only those that
// name its model and software. No address, no user name, no serial number, no name of a place.
constexpr std::string_view kReported[] = {"addresses",
                                          "bytes",
                                          "clockOffsetMilliseconds",
                                          "code",
                                          "codec",
                                          "error",
                                          "expected",
                                          "freeKilobytes",
                                          "interface",
                                          "jitterMilliseconds",
                                          "keyPicture",
                                          "longestGapMilliseconds",
                                          "lost",
                                          "mode",
                                          "model",
                                          "offers",
                                          "pictureLosses",
                                          "pictures",
                                          "port",
                                          "profile",
                                          "seconds",
                                          "size",
                                          "software",
                                          "status"};

// A camera may send anything as its model: one line, without control characters, not endless, without the password.
Json safe(const Json& value, const Redactor& redactor) {
  if (value.is_array()) {
    Json list = Json::array();
    for (const Json& item : value) list.push_back(safe(item, redactor));
    return list;
  }
  if (!value.is_string()) return value;
  return printable(redactor(value.get<std::string>())).substr(0, kLongestText);
}

std::string text_of(const Json& value) {
  if (value.is_string()) return value.get<std::string>();
  if (value.is_boolean()) return value.get<bool>() ? "yes" : "no";
  if (!value.is_array()) return value.dump();
  std::string text;
  for (const Json& item : value) text += (text.empty() ? "" : ", ") + text_of(item);
  return text;
}

// "clockOffsetMilliseconds" as people read it: "clock offset milliseconds".
std::string words_of(std::string_view name) {
  std::string words;
  for (const char c : name) {
    if (c >= 'A' && c <= 'Z') {
      words += ' ';
      words += static_cast<char>(c - 'A' + 'a');
    } else {
      words += c;
    }
  }
  return words;
}

}  // namespace

const char* name_of(Verdict verdict) {
  switch (verdict) {
    case Verdict::kWorks:
      return "works";
    case Verdict::kPartly:
      return "works in part";
    case Verdict::kFails:
      return "does not work";
    case Verdict::kLacking:
      return "not there";
    case Verdict::kUntried:
      break;
  }
  return "not tried";
}

bool may_be_reported(std::string_view field) {
  return std::find(std::begin(kReported), std::end(kReported), field) != std::end(kReported);
}

Json report_of(const std::vector<Check>& checks, const std::string& driver_version, const Redactor& redactor) {
  Json list = Json::array();
  for (const Check& check : checks) {
    Json evidence = Json::object();
    for (const auto& [field, value] : check.evidence) {
      if (may_be_reported(field)) evidence[field] = safe(value, redactor);
    }
    list.push_back({{"name", check.name},
                    {"status", name_of(check.verdict)},
                    {"evidence", std::move(evidence)},
                    {"remedy", check.remedy},
                    {"milliseconds", check.milliseconds}});
  }
  return {{"driverVersion", driver_version}, {"checks", std::move(list)}};
}

std::string text_of_report(const Json& report) {
  std::string text = fmt::format("Driver version {}\n", text_of(report["driverVersion"]));
  for (const Json& check : report["checks"]) {
    std::string line = fmt::format("{:<24} {:<14}", text_of(check["name"]), text_of(check["status"]));
    std::string separator = " ";
    for (const auto& [field, value] : check["evidence"].items()) {
      line += separator + words_of(field) + " " + text_of(value);
      separator = ", ";
    }
    text += line.substr(0, line.find_last_not_of(' ') + 1) + "\n";
    const std::string remedy = text_of(check["remedy"]);
    if (!remedy.empty()) text += "    " + remedy + "\n";
  }
  return text;
}

ExitCode outcome_of(const std::vector<Check>& checks) {
  const auto failed =
      std::find_if(checks.begin(), checks.end(), [](const Check& check) { return check.verdict == Verdict::kFails; });
  return failed == checks.end() ? ExitCode::kOk : failed->code;
}

}  // namespace vexa::host
