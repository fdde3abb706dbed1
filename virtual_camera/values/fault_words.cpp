// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/values/fault_words.h"

#include <chrono>
#include <cstddef>
#include <cstdint>

#include "virtual_camera/values/number_text.h"

namespace vexa::camera {
namespace {

constexpr struct {
  std::string_view word;
  double PacketFaults::*probability;
} kProbabilities[] = {{"loss", &PacketFaults::loss},
                      {"burst-loss", &PacketFaults::burst_loss},
                      {"reorder", &PacketFaults::reorder},
                      {"duplicate", &PacketFaults::duplicate},
                      {"delay", &PacketFaults::delay},
                      {"corrupt", &PacketFaults::corrupt_payload},
                      {"corrupt-header", &PacketFaults::corrupt_header},
                      {"missing-marker", &PacketFaults::missing_marker}};

constexpr struct {
  std::string_view word;
  std::size_t PacketFaults::*count;
} kCounts[] = {{"burst-length", &PacketFaults::burst_length},
               {"reorder-distance", &PacketFaults::reorder_distance},
               {"duplicate-distance", &PacketFaults::duplicate_distance},
               {"corrupt-bits", &PacketFaults::corrupt_bits}};
// Packets held back take memory.
constexpr std::uint32_t kMostPackets = 100000;
constexpr std::uint32_t kLongestDelay = 60000;  // milliseconds
constexpr std::string_view kDelayTime = "delay-ms";

std::optional<std::uint32_t> count_of(std::string_view value, std::uint32_t most) {
  const auto count = whole_number<std::uint32_t>(value);
  return count && *count <= most ? count : std::nullopt;
}

using Milliseconds = std::chrono::milliseconds;

constexpr struct {
  std::string_view word;
  RequestFault (*make)(std::string match);
} kPlainFaults[] = {{"no-answer", RequestFault::no_answer},
                    {"reset", RequestFault::reset},
                    {"wrong-credentials", RequestFault::wrong_credentials}};

constexpr struct {
  std::string_view word;
  RequestFault (*make)(std::string match, Milliseconds time);
} kTimedFaults[] = {{"slow-answer", RequestFault::slow},
                    {"byte-at-a-time", RequestFault::byte_at_a_time},
                    {"reboot", RequestFault::reboot}};

constexpr struct {
  std::string_view word;
  RequestFault (*make)(std::string match, std::size_t bytes);
} kCutFaults[] = {{"cut-answer", RequestFault::cut_after}, {"stall-answer", RequestFault::stall_after}};

}  // namespace

bool set_packet_fault(PacketFaults& faults, std::string_view word, std::string_view value) {
  for (const auto& row : kProbabilities) {
    if (row.word != word) continue;
    const auto probability = whole_number<double>(value);
    if (!probability || !(*probability >= 0 && *probability <= 1)) return false;
    faults.*row.probability = *probability;
    return true;
  }
  for (const auto& row : kCounts) {
    if (row.word != word) continue;
    const auto count = count_of(value, kMostPackets);
    if (count) faults.*row.count = *count;
    return count.has_value();
  }
  const auto delay = word == kDelayTime ? count_of(value, kLongestDelay) : std::nullopt;
  if (delay) faults.delay_time = Milliseconds(*delay);
  return delay.has_value();
}

std::vector<std::pair<std::string_view, double>> packet_fault_values(const PacketFaults& faults) {
  std::vector<std::pair<std::string_view, double>> values;
  for (const auto& row : kProbabilities) values.emplace_back(row.word, faults.*row.probability);
  for (const auto& row : kCounts) values.emplace_back(row.word, static_cast<double>(faults.*row.count));
  values.emplace_back(kDelayTime, static_cast<double>(faults.delay_time.count()));
  return values;
}

namespace {

// Of every match.
std::optional<RequestFault> plain_request_fault(std::string_view word, const std::string& part,
                                                std::string_view value) {
  for (const auto& row : kPlainFaults) {
    if (row.word == word && value.empty()) return row.make(part);
  }
  const auto number = whole_number<std::uint32_t>(value);
  for (const auto& row : kTimedFaults) {
    if (row.word == word && number) return row.make(part, Milliseconds(*number));
  }
  for (const auto& row : kCutFaults) {
    if (row.word == word && number) return row.make(part, *number);
  }
  if (word == "status" && !value.empty()) return RequestFault::status(part, std::string(value));
  if (word == "raw-answer") return RequestFault::raw(part, unescaped(value));
  return std::nullopt;
}

}  // namespace

std::optional<RequestFault> request_fault(std::string_view word, std::string_view match, std::string_view value) {
  const std::size_t mark = match.rfind('#');
  std::optional<RequestFault> fault = plain_request_fault(word, std::string(match.substr(0, mark)), value);
  if (!fault || mark == std::string_view::npos) return fault;
  const auto occurrence = whole_number<std::uint32_t>(match.substr(mark + 1));
  return occurrence ? std::optional(fault->nth(*occurrence)) : std::nullopt;
}

std::string unescaped(std::string_view text) {
  std::string bytes;
  for (std::size_t i = 0; i < text.size(); ++i) {
    const bool escape = text[i] == '\\' && i + 1 < text.size();
    if (!escape) {
      bytes += text[i];
      continue;
    }
    const char letter = text[++i];
    bytes += letter == 'r' ? '\r' : letter == 'n' ? '\n' : letter;
  }
  return bytes;
}

}  // namespace vexa::camera
