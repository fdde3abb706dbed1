#include "host/cgi_log/cgi_log_rows.h"

#include <fmt/format.h>

#include <nlohmann/json.hpp>

#include "host/base/printable.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

struct Cells {
  std::string_view time;
  std::string_view duration;
  std::string_view status;
  std::string_view request;
  std::string_view answer;
};

constexpr std::string_view kNone = "-";

std::string to_line(const Cells& cells) {
  return fmt::format("{:<23}  {:>6}  {:>6}  {:<40}  {}\n", cells.time, cells.duration, cells.status, cells.request,
                     cells.answer);
}

std::string to_text(LogTime time, char separator) {
  using namespace std::chrono;
  const auto midnight = floor<days>(time);
  const year_month_day date{midnight};
  const hh_mm_ss clock{time - midnight};
  return fmt::format("{:04}-{:02}-{:02}{}{:02}:{:02}:{:02}.{:03}", static_cast<int>(date.year()),
                     static_cast<unsigned>(date.month()), static_cast<unsigned>(date.day()), separator,
                     clock.hours().count(), clock.minutes().count(), clock.seconds().count(),
                     clock.subseconds().count());
}

LogTime time_of(const CgiExchange& exchange) {
  return exchange.request ? exchange.request->time : exchange.answer->time;
}

}  // namespace

std::string table_head() {
  return to_line({.time = "Time", .duration = "ms", .status = "Status", .request = "Request", .answer = "Answer"});
}

std::string table_row(const CgiExchange& exchange, const Redactor& redactor) {
  const auto& [request, answer] = exchange;
  const auto duration = exchange.duration();
  const std::string time = to_text(time_of(exchange), ' ');
  const std::string milliseconds(duration ? fmt::format("{}", duration->count()) : kNone);
  const std::string status(answer && answer->status ? fmt::format("{}", *answer->status) : kNone);
  const std::string path(request ? printable(redactor(request->path)) : kNone);
  const std::string reason = answer ? printable(redactor(answer->reason)) : "no answer";
  return to_line({.time = time, .duration = milliseconds, .status = status, .request = path, .answer = reason});
}

std::string json_row(const CgiExchange& exchange, const Redactor& redactor) {
  const auto& [request, answer] = exchange;
  const auto duration = exchange.duration();
  Json json;
  json["time"] = to_text(time_of(exchange), 'T');
  json["path"] = request ? Json(redactor(request->path)) : Json(nullptr);
  json["status"] = answer && answer->status ? Json(*answer->status) : Json(nullptr);
  json["reason"] = answer ? Json(redactor(answer->reason)) : Json(nullptr);
  json["milliseconds"] = duration ? Json(duration->count()) : Json(nullptr);
  return json.dump(-1, ' ', true, Json::error_handler_t::replace) + "\n";
}

}  // namespace vexa::host
