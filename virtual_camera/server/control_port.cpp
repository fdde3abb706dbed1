// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/control_port.h"

#include <fmt/format.h>

#include <asio/buffer.hpp>
#include <asio/io_context.hpp>
#include <asio/read_until.hpp>
#include <asio/steady_timer.hpp>
#include <asio/write.hpp>
#include <chrono>
#include <optional>
#include <utility>

namespace vexa::camera {
namespace {

constexpr std::size_t kLongestRequest = 4096;
constexpr std::size_t kMostVisits = 64;  // more are closed at once
constexpr std::chrono::seconds kVisitLimit{10};

// The name without the port: "localhost:8080", "[::1]:8080".
std::string_view host_name(std::string_view host) {
  const std::size_t bracket = host.rfind(']');
  const std::size_t colon = host.find(':', bracket == std::string_view::npos ? 0 : bracket);
  return host.substr(0, colon);
}

}  // namespace

// Ends when its answer has left, or with its time. Keeps its port, which counts it.
struct ControlPort::Visit {
  Visit(asio::ip::tcp::socket taken, std::shared_ptr<ControlPort> of)
      : socket(std::move(taken)), limit(socket.get_executor()), port(std::move(of)) {
    ++port->visits_;
  }
  ~Visit() { --port->visits_; }
  Visit(const Visit&) = delete;
  Visit& operator=(const Visit&) = delete;

  asio::ip::tcp::socket socket;
  asio::steady_timer limit;
  std::shared_ptr<ControlPort> port;
  std::string request;
  std::string answer;
};

std::string control_answer(std::string_view status, std::string_view type, std::string_view body) {
  if (status.starts_with("204")) return fmt::format("HTTP/1.0 {}\r\n\r\n", status);
  const std::string type_line = type.empty() ? "" : fmt::format("Content-Type: {}; charset=utf-8\r\n", type);
  return fmt::format(
      "HTTP/1.0 {}\r\n{}Content-Length: {}\r\nCache-Control: no-store\r\nX-Content-Type-Options: nosniff\r\n"
      "Cross-Origin-Resource-Policy: same-origin\r\nContent-Security-Policy: default-src 'self'; frame-ancestors "
      "'none'\r\n\r\n{}",
      status, type_line, body.size(), body);
}

std::string_view control_refusal(const RequestHead& request) {
  const std::string_view host = host_name(request.field("Host"));
  const bool own_host = host.empty() || host == "localhost" || host == "127.0.0.1";
  if (!own_host) return "421 Misdirected Request";
  const std::string_view site = request.field("Sec-Fetch-Site");
  const bool own_page = site.empty() || site == "same-origin" || site == "none";
  const std::string_view origin = request.field("Origin");
  const bool own_origin = origin.empty() || origin == fmt::format("http://{}", request.field("Host"));
  return own_page && own_origin ? std::string_view() : "403 Forbidden";
}

ControlPort::ControlPort(asio::io_context& context, Answerer answerer)
    : context_(context), answerer_(std::move(answerer)) {}

asio::error_code ControlPort::open(std::uint16_t port) {
  if (!listener_) {
    const auto take_visit = [weak = weak_from_this()](asio::ip::tcp::socket socket) {
      if (const std::shared_ptr<ControlPort> self = weak.lock()) self->take(std::move(socket));
    };
    listener_ = std::make_shared<Listener>(context_, "127.0.0.1", take_visit);
  }
  return listener_->open(port);
}

void ControlPort::close() {
  if (listener_) listener_->close();
}

void ControlPort::take(asio::ip::tcp::socket socket) {
  if (visits_ >= kMostVisits) return;
  const auto visit = std::make_shared<Visit>(std::move(socket), shared_from_this());
  visit->limit.expires_after(kVisitLimit);
  visit->limit.async_wait([weak = std::weak_ptr<Visit>(visit)](asio::error_code stopped) {
    const std::shared_ptr<Visit> late = stopped ? nullptr : weak.lock();
    asio::error_code ignored;
    if (late) late->socket.close(ignored);
  });
  asio::async_read_until(visit->socket, asio::dynamic_buffer(visit->request, kLongestRequest), "\r\n\r\n",
                         [visit](asio::error_code error, std::size_t) {
                           if (error) return;
                           visit->answer = visit->port->answer(visit->request);
                           asio::async_write(visit->socket, asio::buffer(visit->answer),
                                             [visit](asio::error_code, std::size_t) {});
                         });
}

std::string ControlPort::answer(const std::string& text) const {
  const std::optional<RequestHead> request = parse_head(text);
  if (!request) return control_answer("400 Bad Request");
  const std::string_view refusal = control_refusal(*request);
  if (!refusal.empty()) return control_answer(refusal);
  if (request->method != "GET" && request->method != "POST") return control_answer("405 Method Not Allowed");
  return answerer_(*request);
}

}  // namespace vexa::camera
