// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/program/fault_arguments.h"

#include <fmt/format.h>

#include <chrono>
#include <cstdint>
#include <optional>
#include <string_view>

#include "virtual_camera/values/fault_words.h"
#include "virtual_camera/values/number_text.h"

namespace vexa::camera {
namespace {

constexpr const char* kPacketGroup = "Packet faults (P is a probability from 0 to 1)";
constexpr const char* kRequestGroup =
    "Request faults (MATCH is a part of the request's text; MATCH#N applies to the Nth match only)";
constexpr const char* kStreamGroup =
    "Faults of HTTP streams (N is a picture, or a piece of sound, counted from 0 in each stream)";

template <typename Number>
Number number_of(std::string_view text) {
  const std::optional<Number> number = whole_number<Number>(text);
  if (!number) throw CLI::ValidationError("fault value", "not a number in range: " + std::string(text));
  return *number;
}

std::chrono::milliseconds milliseconds_of(std::string_view text) {
  return std::chrono::milliseconds(number_of<std::uint32_t>(text));
}

// "PICTURE" or "PICTURE=VALUE".
template <typename Restart>
Restart restart_of(std::string_view text) {
  const std::size_t equals = text.find('=');
  Restart restart;
  restart.picture = number_of<std::uint64_t>(text.substr(0, equals));
  if (equals != std::string_view::npos) {
    using Value = typename decltype(restart.value)::value_type;
    restart.value = number_of<Value>(text.substr(equals + 1));
  }
  return restart;
}

// The fault's word of an option's name.
std::string word_of(std::string_view option) { return std::string(option.substr(2)); }

}  // namespace

void FaultArguments::add_to(CLI::App& app, PacketFaults& faults) {
  add_packet_faults(app, faults);
  add_request_faults(app);
  add_stream_faults(app);
}

void FaultArguments::add_packet_faults(CLI::App& app, PacketFaults& faults) {
  const auto probability = [&app](const char* name, double& value, const char* help) {
    app.add_option(name, value, help)->type_name("P")->check(CLI::Range(0.0, 1.0))->group(kPacketGroup);
  };
  const auto count = [&app](const char* name, auto& value, const char* help) {
    app.add_option(name, value, help)->type_name("N")->capture_default_str()->group(kPacketGroup);
  };
  probability("--loss", faults.loss, "lose a packet");
  probability("--burst-loss", faults.burst_loss, "begin a burst of lost packets");
  count("--burst-length", faults.burst_length, "packets lost in a burst");
  probability("--reorder", faults.reorder, "hold a packet back until later ones have left");
  count("--reorder-distance", faults.reorder_distance, "at most this many later ones");
  probability("--duplicate", faults.duplicate, "send a packet twice");
  count("--duplicate-distance", faults.duplicate_distance, "the second after at most this many later packets");
  probability("--delay", faults.delay, "delay a packet");
  app.add_option_function<std::uint32_t>(
         "--delay-ms", [&faults](std::uint32_t ms) { faults.delay_time = std::chrono::milliseconds(ms); },
         "by this time [100]")
      ->type_name("MS")
      ->group(kPacketGroup);
  probability("--corrupt", faults.corrupt_payload, "flip bits in a packet's payload");
  count("--corrupt-bits", faults.corrupt_bits, "this many bits");
  probability("--corrupt-header", faults.corrupt_header, "flip a bit in a packet's RTP header");
  probability("--missing-marker", faults.missing_marker, "clear the marker of a picture's last packet");
  app.add_option("--restart-sequence", sequence_restarts_, "restart sequence numbers before this picture")
      ->type_name("PICTURE[=VALUE]")
      ->group(kPacketGroup);
  app.add_option("--restart-timestamp", timestamp_restarts_, "restart timestamps before this picture")
      ->type_name("PICTURE[=VALUE]")
      ->group(kPacketGroup);
}

void FaultArguments::add_request_faults(CLI::App& app) {
  const auto plain = [this, &app](const char* name, const char* help) {
    std::vector<std::string>& matches = plain_.emplace_back(word_of(name), std::vector<std::string>()).second;
    app.add_option(name, matches, help)->type_name("MATCH")->allow_extra_args(false)->group(kRequestGroup);
  };
  const auto valued = [this, &app](const char* name, const char* help) {
    Pairs& pairs = valued_.emplace_back(word_of(name), Pairs()).second;
    app.add_option(name, pairs, help)->type_name("")->allow_extra_args(false)->group(kRequestGroup);
  };
  plain("--no-answer", "never answer");
  plain("--reset", "reset the connection");
  plain("--wrong-credentials", "refuse the credentials");
  valued("--slow-answer", "MATCH MS: answer after this time");
  valued("--byte-at-a-time", "MATCH MS: this time between single bytes");
  valued("--cut-answer", "MATCH BYTES: close after this many bytes");
  valued("--stall-answer", "MATCH BYTES: fall silent after this many bytes");
  valued("--status", "MATCH STATUS: answer this, such as \"503 Service Unavailable\"");
  valued("--raw-answer", "MATCH TEXT: answer this text (\\r and \\n are known)");
  valued("--reboot", "MATCH MS: vanish without an answer, come back after this time");
}

void FaultArguments::add_stream_faults(CLI::App& app) {
  const auto valued = [&app](const char* name, Pairs& pairs, const char* help) {
    app.add_option(name, pairs, help)->type_name("")->allow_extra_args(false)->group(kStreamGroup);
  };
  valued("--part-length", part_length_, "N TEXT: TEXT follows \"DataLen: \"");
  app.add_option("--no-part-length", no_part_length_, "the part does not announce its length")
      ->type_name("N")
      ->allow_extra_args(false)
      ->group(kStreamGroup);
  valued("--before-picture", before_picture_, "N TEXT: TEXT comes before it (\\r and \\n are known)");
  valued("--cut-picture", cut_picture_, "N BYTES: only so many bytes of it are sent");
  valued("--close-stream", close_stream_, "N BYTES: the connection closes after so many bytes of it");
  valued("--silence-stream", silence_, "N BYTES: it falls silent after so many bytes");
  valued("--pause-stream", pause_, "N MS: it comes later by this time, and so does all that follows");
  valued("--other-clip", other_clip_, "N FILE: from here on the stream sends this file");
}

void FaultArguments::apply_stream_faults(CameraOptions& options) const {
  using Action = HttpStreamFault::Action;
  const auto add = [&options](Action action, std::string_view index) -> HttpStreamFault& {
    HttpStreamFault& fault = options.stream_faults.emplace_back();
    fault.index = number_of<std::uint64_t>(index);
    fault.action = action;
    return fault;
  };
  for (const std::string& index : no_part_length_) add(Action::kNoDataLength, index);
  for (const auto& [index, text] : part_length_) add(Action::kDataLength, index).text = text;
  for (const auto& [index, text] : before_picture_) add(Action::kBefore, index).text = unescaped(text);
  for (const auto& [index, bytes] : cut_picture_) add(Action::kCut, index).bytes = number_of<std::uint32_t>(bytes);
  for (const auto& [index, bytes] : close_stream_) add(Action::kClose, index).bytes = number_of<std::uint32_t>(bytes);
  for (const auto& [index, bytes] : silence_) add(Action::kSilence, index).bytes = number_of<std::uint32_t>(bytes);
  for (const auto& [index, ms] : pause_) add(Action::kPause, index).time = milliseconds_of(ms);
  for (const auto& [index, file] : other_clip_) add(Action::kOtherClip, index).text = file;
}

void FaultArguments::apply(CameraOptions& options) const {
  apply_stream_faults(options);
  for (const std::string& text : sequence_restarts_) {
    options.packet_faults.sequence_restarts.push_back(restart_of<SequenceRestart>(text));
  }
  for (const std::string& text : timestamp_restarts_) {
    options.packet_faults.timestamp_restarts.push_back(restart_of<TimestampRestart>(text));
  }
  const auto add = [&options](const std::string& word, std::string_view match, std::string_view value) {
    std::optional<RequestFault> fault = request_fault(word, match, value);
    if (!fault)
      throw CLI::ValidationError("--" + word, fmt::format("cannot be used as it stands: {} {}", match, value));
    options.request_faults.push_back(std::move(*fault));
  };
  for (const auto& [word, matches] : plain_) {
    for (const std::string& match : matches) add(word, match, {});
  }
  for (const auto& [word, pairs] : valued_) {
    for (const auto& [match, value] : pairs) add(word, match, value);
  }
}

}  // namespace vexa::camera
