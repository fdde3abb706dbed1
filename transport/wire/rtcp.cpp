#include "transport/wire/rtcp.h"

#include <algorithm>
#include <utility>

namespace vexa {
namespace {

constexpr std::uint8_t kVersion = 2;
constexpr std::uint8_t kSenderReport = 200;
constexpr std::uint8_t kReceiverReport = 201;
constexpr std::uint8_t kSourceDescription = 202;
constexpr std::uint8_t kCname = 1;
constexpr std::size_t kWord = 4;
constexpr std::size_t kMostText = 255;
constexpr std::int32_t kMostLost = 0x7fffff;
constexpr std::int32_t kLeastLost = -0x800000;

constexpr std::int64_t kNanosecondsASecond = 1'000'000'000;
constexpr std::int64_t kSecondsTo1970 = 2'208'988'800;
constexpr std::int64_t kSecondsOfAnEra = std::int64_t{1} << 32;
constexpr std::uint32_t kFirstSecondOf1968 = 0x80000000;

/// Appends big-endian numbers.
class Writer {
 public:
  void u8(std::uint32_t value) { bytes_.push_back(static_cast<unsigned char>(value)); }
  void u16(std::uint32_t value) {
    u8(value >> 8);
    u8(value);
  }
  void u32(std::uint32_t value) {
    u16(value >> 16);
    u16(value);
  }
  void text(std::string_view text) { bytes_.insert(bytes_.end(), text.begin(), text.end()); }
  void header(std::uint8_t count, std::uint8_t type, std::size_t words) {
    u8(static_cast<std::uint32_t>(kVersion << 6 | count));
    u8(type);
    u16(static_cast<std::uint32_t>(words - 1));
  }
  std::size_t size() const { return bytes_.size(); }
  std::vector<unsigned char> take() { return std::move(bytes_); }

 private:
  std::vector<unsigned char> bytes_;
};

}  // namespace

std::optional<SenderReport> find_sender_report(Bytes compound) {
  ByteReader in(compound);
  for (bool first = true; !in.rest().empty(); first = false) {
    const std::uint8_t front = in.u8();
    const std::uint8_t type = in.u8();
    const std::uint16_t words = in.u16();
    if (front >> 6 != kVersion) return std::nullopt;
    if (first && type != kSenderReport && type != kReceiverReport) return std::nullopt;
    ByteReader body(in.take(words * kWord));
    if (!in.ok()) return std::nullopt;
    if (type != kSenderReport) continue;
    SenderReport report;
    report.ssrc = body.u32();
    report.ntp = std::uint64_t{body.u32()} << 32;
    report.ntp |= body.u32();
    report.rtp_time = body.u32();
    body.u32();  // packets sent
    body.u32();  // bytes sent
    if (!body.ok()) return std::nullopt;
    return report;
  }
  return std::nullopt;
}

std::vector<unsigned char> receiver_report(const ReceptionReport& report, std::string_view cname) {
  Writer out;
  out.header(1, kReceiverReport, 8);
  out.u32(report.reporter);
  out.u32(report.source);
  const std::int32_t lost = std::clamp(report.lost, kLeastLost, kMostLost);
  out.u32(std::uint32_t{report.fraction_lost} << 24 | (static_cast<std::uint32_t>(lost) & 0xffffff));
  out.u32(report.highest_sequence);
  out.u32(report.jitter);
  out.u32(report.last_report);
  out.u32(report.since_last_report);
  const std::string_view name = cname.substr(0, kMostText);
  // SSRC, the item's type and length, its text, and one to four zeros to a whole word.
  const std::size_t words = 1 + (kWord + 2 + name.size()) / kWord + 1;
  const std::size_t end = out.size() + words * kWord;
  out.header(1, kSourceDescription, words);
  out.u32(report.reporter);
  out.u8(kCname);
  out.u8(static_cast<std::uint32_t>(name.size()));
  out.text(name);
  while (out.size() < end) out.u8(0);
  return out.take();
}

std::int64_t unix_nanoseconds(std::uint64_t ntp) {
  const auto seconds = static_cast<std::uint32_t>(ntp >> 32);
  const std::uint64_t fraction = ntp & 0xffffffff;
  const std::int64_t era = seconds < kFirstSecondOf1968 ? kSecondsOfAnEra : 0;
  return (seconds + era - kSecondsTo1970) * kNanosecondsASecond +
         static_cast<std::int64_t>(fraction * static_cast<std::uint64_t>(kNanosecondsASecond) >> 32);
}

}  // namespace vexa
