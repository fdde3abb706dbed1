// SPDX-License-Identifier: Apache-2.0
// Sender reports out of any compound packet, as a second reader finds them, and the sender's clock out of them. The
// first byte of the input chooses the clock rate; each record is a packet.
#include <optional>
#include <vector>

#include "fuzz/records.h"
#include "transport/wire/rtcp.h"
#include "transport/wire/sender_clock.h"

namespace {

using vexa_fuzz::check;

constexpr int kRates[] = {90000, 8000, 1, 0, 2147483647, -1};

std::uint32_t word_at(vexa::Bytes bytes, std::size_t at) {
  return std::uint32_t{bytes[at]} << 24 | std::uint32_t{bytes[at + 1]} << 16 | std::uint32_t{bytes[at + 2]} << 8 |
         bytes[at + 3];
}

/// RFC 3550, 6.4.1 and A.2, by offsets.
std::optional<vexa::SenderReport> reference(vexa::Bytes compound) {
  std::size_t at = 0;
  while (at + 4 <= compound.size()) {
    const std::size_t length = 4 * (std::size_t{compound[at + 2]} * 256 + compound[at + 3] + 1);
    const bool may_begin = compound[at + 1] == 200 || compound[at + 1] == 201;
    if (compound[at] >> 6 != 2 || (at == 0 && !may_begin) || length > compound.size() - at) return std::nullopt;
    if (compound[at + 1] == 200) {
      if (length < 28) return std::nullopt;
      return vexa::SenderReport{word_at(compound, at + 4),
                                std::uint64_t{word_at(compound, at + 8)} << 32 | word_at(compound, at + 12),
                                word_at(compound, at + 16)};
    }
    at += length;
  }
  return std::nullopt;
}

void check_answer(const vexa::SenderReport& report) {
  vexa::ReceptionReport reception;
  reception.reporter = report.rtp_time;
  reception.source = report.ssrc;
  reception.lost = static_cast<std::int32_t>(report.ntp);
  const std::vector<unsigned char> bytes = vexa::receiver_report(reception, "name");
  check(bytes.size() % 4 == 0 && word_at(bytes, 4) == report.rtp_time && word_at(bytes, 8) == report.ssrc);
  check(!vexa::find_sender_report(bytes));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  const int rate = kRates[data[0] % std::size(kRates)];
  vexa_fuzz::Records records({data + 1, size - 1});
  vexa::SenderClock clock;
  std::int64_t moment = 0;
  while (const auto record = records.next()) {
    const auto report = vexa::find_sender_report(*record);
    const auto expected = reference(*record);
    check(report.has_value() == expected.has_value());
    moment += 1'000'000 + static_cast<std::int64_t>(record->size()) * 100'000'000;
    if (!report) continue;
    check(report->ssrc == expected->ssrc && report->ntp == expected->ntp && report->rtp_time == expected->rtp_time);
    check_answer(*report);
    clock.report(*report, {1'700'000'000'000'000'000 + moment, moment}, rate);
    static_cast<void>(clock.time_of(report->rtp_time + 3600, rate));
    const auto offset = clock.offset({1'700'000'000'000'000'000 + moment, moment});
    if (offset) check(std::abs(vexa::local_time_minutes(*offset)) <= 14 * 60);
  }
  return 0;
}
