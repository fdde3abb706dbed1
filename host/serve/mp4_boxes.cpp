// SPDX-License-Identifier: Apache-2.0
#include "host/serve/mp4_boxes.h"

#include <cstddef>
#include <utility>

namespace vexa::host {
namespace {

// Bytes in network order, appended one after the other.
class Box {
 public:
  Box& u8(std::uint32_t value) { return number(value, 1); }
  Box& u16(std::uint32_t value) { return number(value, 2); }
  Box& u32(std::uint32_t value) { return number(value, 4); }
  Box& u64(std::uint64_t value) {
    return u32(static_cast<std::uint32_t>(value >> 32U)).u32(static_cast<std::uint32_t>(value));
  }
  Box& zeros(std::size_t count) {
    bytes_.append(count, '\0');
    return *this;
  }
  Box& text(std::string_view bytes) {
    bytes_ += bytes;
    return *this;
  }
  // The identity matrix of a track.
  Box& matrix() { return u32(0x10000).zeros(12).u32(0x10000).zeros(12).u32(0x40000000); }

  // The whole box: its length, its type and what was appended.
  [[nodiscard]] std::string as(std::string_view type) const {
    Box whole;
    whole.u32(static_cast<std::uint32_t>(bytes_.size() + 8)).text(type).text(bytes_);
    return std::move(whole.bytes_);
  }

 private:
  Box& number(std::uint32_t value, unsigned bytes) {
    while (bytes-- > 0) bytes_ += static_cast<char>((value >> (8 * bytes)) & 0xFFU);
    return *this;
  }

  std::string bytes_;
};

constexpr std::uint32_t kTrack = 1;

std::string decoder_configuration(std::string_view sps, std::string_view pps) {
  Box box;
  box.u8(1).text(sps.substr(1, 3));
  box.u8(0xFF);                                                        // lengths of four bytes
  box.u8(0xE1).u16(static_cast<std::uint32_t>(sps.size())).text(sps);  // one of each
  return box.u8(1).u16(static_cast<std::uint32_t>(pps.size())).text(pps).as("avcC");
}

std::string sample_table(std::string_view sps, std::string_view pps, PictureSize size) {
  const std::string entry = Box()
                                .zeros(6)
                                .u16(1)
                                .zeros(16)
                                .u16(size.width)
                                .u16(size.height)
                                .u32(0x480000)  // 72 dots an inch
                                .u32(0x480000)
                                .zeros(4)
                                .u16(1)
                                .zeros(32)
                                .u16(24)
                                .u16(0xFFFF)
                                .text(decoder_configuration(sps, pps))
                                .as("avc1");
  return Box()
      .text(Box().u32(0).u32(1).text(entry).as("stsd"))
      .text(Box().zeros(8).as("stts"))
      .text(Box().zeros(8).as("stsc"))
      .text(Box().zeros(12).as("stsz"))
      .text(Box().zeros(8).as("stco"))
      .as("stbl");
}

std::string media(std::string_view sps, std::string_view pps, PictureSize size) {
  const std::string source = Box().u32(0).u32(1).text(Box().u32(1).as("url ")).as("dref");
  const std::string information = Box()
                                      .text(Box().u32(1).zeros(8).as("vmhd"))
                                      .text(Box().text(source).as("dinf"))
                                      .text(sample_table(sps, pps, size))
                                      .as("minf");
  return Box()
      .text(Box().zeros(12).u32(kVideoClock).u32(0).u16(0x55C4).u16(0).as("mdhd"))  // language: undetermined
      .text(Box().zeros(8).text("vide").zeros(13).as("hdlr"))
      .text(information)
      .as("mdia");
}

}  // namespace

std::string init_segment(std::string_view sps, std::string_view pps, PictureSize size) {
  const std::string header = Box()
                                 .zeros(12)
                                 .u32(kVideoClock)
                                 .u32(0)
                                 .u32(0x10000)
                                 .u16(0x100)
                                 .zeros(10)
                                 .matrix()
                                 .zeros(24)
                                 .u32(kTrack + 1)
                                 .as("mvhd");
  const std::string track_header = Box()
                                       .u32(3)  // enabled, in the movie
                                       .zeros(8)
                                       .u32(kTrack)
                                       .zeros(24)
                                       .matrix()
                                       .u32(size.width << 16U)
                                       .u32(size.height << 16U)
                                       .as("tkhd");
  const std::string extends = Box().u32(0).u32(kTrack).u32(1).zeros(12).as("trex");
  return Box().text("iso5").u32(512).text("iso5iso6avc1mp41").as("ftyp") +
         Box()
             .text(header)
             .text(Box().text(track_header).text(media(sps, pps, size)).as("trak"))
             .text(Box().text(extends).as("mvex"))
             .as("moov");
}

std::string media_fragment(const Mp4Sample& sample, std::string_view samples) {
  const auto moof = [&](std::uint32_t offset) {
    const std::uint32_t flags = sample.is_key ? 0x02000000 : 0x01010000;
    const std::string run = Box()
                                .u32(0x000701)  // offset of the data; duration, size and flags of each
                                .u32(1)
                                .u32(offset)
                                .u32(sample.duration)
                                .u32(static_cast<std::uint32_t>(samples.size()))
                                .u32(flags)
                                .as("trun");
    const std::string track = Box()
                                  .text(Box().u32(0x020000).u32(kTrack).as("tfhd"))  // offsets count from the moof
                                  .text(Box().u32(0x01000000).u64(sample.time).as("tfdt"))
                                  .text(run)
                                  .as("traf");
    return Box().text(Box().u32(0).u32(sample.number).as("mfhd")).text(track).as("moof");
  };
  const std::size_t length = moof(0).size();
  return moof(static_cast<std::uint32_t>(length + 8)) + Box().text(samples).as("mdat");
}

}  // namespace vexa::host
