// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/rtp_pictures.h"

#include "media/assembly/frame_writer.h"
#include "media/assembly/jfif_header.h"

namespace vexa {
namespace {

constexpr int kJpegPayloadType = 26;  // RFC 3551, table 5

constexpr std::size_t kUserDataBlock = 168;
constexpr std::size_t kJpegHeader = 8;
constexpr std::size_t kJpegHeaderWithRestart = 12;
constexpr std::size_t kTypeOffset = 4;
constexpr std::uint8_t kTablesInBand = 128;
constexpr std::uint8_t kTablesLength = 128;
/// Below this length a further packet, RTP header included, cannot hold a restart-marker header.
constexpr std::uint32_t kLeastPacketWithRestart = 24;

constexpr unsigned char kOpensHere = 1;
constexpr unsigned char kOpensElsewhere = 2;

constexpr bool carries_restart_interval(std::uint8_t type) { return type >= 64 && type <= 127; }

/// The contents of the header of a picture's first packet.
struct JpegHeader {
  JpegShape shape;
  std::uint8_t q;
};

JpegHeader read_jpeg_header(ByteReader& in) {
  in.u8();   // type-specific
  in.u24();  // fragment offset: the packets' order is known already
  const std::uint8_t type = in.u8();
  JpegHeader header{};
  header.q = in.u8();
  header.shape.width_in_8 = in.u8();
  header.shape.height_in_8 = in.u8();
  if (carries_restart_interval(type)) {
    header.shape.restart_interval = in.u16();
    in.u16();  // F, L and the restart count
  }
  return header;
}

void copy_table(ByteReader& in, QuantisationTable& table) {
  const Bytes bytes = in.take(table.size());
  std::copy(bytes.begin(), bytes.end(), table.begin());
}

/// The tables in band; nullopt unless they are two of 64 bytes.
std::optional<QuantisationTables> read_jpeg_tables(ByteReader& in) {
  in.u8();  // must be zero
  in.u8();  // precision
  in.u8();
  // Kept: of the length's two bytes the low one alone must be right; cameras leave anything in the high one.
  if (in.u8() != kTablesLength) return std::nullopt;
  QuantisationTables tables{};
  copy_table(in, tables.luminance);
  copy_table(in, tables.chrominance);
  if (!in.ok()) return std::nullopt;
  return tables;
}

Bytes behind_user_data(Bytes payload) {
  if (!leads_with_user_data(payload)) return payload;
  // Safe: a block cut short leaves no bytes to read instead of a length below zero.
  return payload.subspan(std::min(payload.size(), kUserDataBlock));
}

/// The scan data of a packet that is not the first of its picture.
Bytes further_scan_data(const SPacketInfo& packet) {
  const Bytes payload = payload_of(packet);
  if (payload.size() <= kJpegHeader) return {};
  // Kept: a packet too short for the longer header is read with the shorter one, whatever its type.
  const bool restart = carries_restart_interval(payload[kTypeOffset]) && packet.length >= kLeastPacketWithRestart;
  return payload.subspan(restart ? kJpegHeaderWithRestart : kJpegHeader);
}

bool is_jpeg_key(PacketRun) { return true; }

std::uint8_t jpeg_opening(const SPacketInfo& first) {
  ByteReader in(behind_user_data(payload_of(first)));
  in.u8();
  return in.u24() == 0 ? kOpensHere : kOpensElsewhere;
}

bool is_no_preamble(const SPacketInfo&) { return false; }

bool opens_at_zero(PacketRun run, bool) { return jpeg_opening(run.front()) == kOpensHere; }

}  // namespace

bool leads_with_user_data(Bytes payload) { return payload.size() >= 2 && payload[0] == 0xff && payload[1] == 0xd8; }

std::optional<std::uint32_t> begin_jfif(std::span<unsigned char> out, Bytes payload) {
  ByteReader in(behind_user_data(payload));
  const JpegHeader header = read_jpeg_header(in);
  if (!in.ok()) return std::nullopt;
  const auto tables = header.q < kTablesInBand ? quantisation_tables(header.q) : read_jpeg_tables(in);
  if (!tables) return std::nullopt;
  FrameWriter writer(out);
  append_jfif_header(writer, header.shape, *tables);
  writer.append(in.rest());
  // Safe: what does not fit is refused before it is written, not after.
  if (!writer.fits()) return std::nullopt;
  return static_cast<std::uint32_t>(writer.length());
}

AssembledPicture assemble_jpeg(Bytes beginning, PacketRun others, std::span<unsigned char> frame) {
  FrameWriter writer(frame);
  writer.append(beginning);
  for (const SPacketInfo& packet : others) writer.append(further_scan_data(packet));
  // Safe: a picture larger than the frame is reported as such instead of being written past its end.
  return {writer.fits() ? Assembly::kWhole : Assembly::kTooLarge, static_cast<std::uint32_t>(writer.length()),
          VIDEO_FRAME_JPEG};
}

const PictureRules kJpegRules{kJpegPayloadType, is_jpeg_key, jpeg_opening, is_no_preamble, opens_at_zero};

}  // namespace vexa
