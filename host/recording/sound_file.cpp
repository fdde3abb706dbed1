// SPDX-License-Identifier: Apache-2.0
#include "host/recording/sound_file.h"

#include <algorithm>
#include <array>
#include <string_view>

#include "host/base/file_extension.h"

namespace vexa::host {
namespace {

constexpr std::size_t kHeaderSize = 58;
constexpr std::uint32_t kFormatSize = 18;
constexpr std::uint32_t kMuLaw = 7;
constexpr std::uint32_t kSampleRate = 8000;

// Fills a header from its beginning.
class HeaderWriter {
 public:
  void text(std::string_view text) {
    for (const char letter : text) bytes_[place_++] = static_cast<unsigned char>(letter);
  }
  void number(std::uint32_t value, int bytes) {
    for (int i = 0; i < bytes; ++i) bytes_[place_++] = static_cast<unsigned char>(value >> (8 * i));
  }
  [[nodiscard]] const std::array<unsigned char, kHeaderSize>& bytes() const { return bytes_; }

 private:
  std::array<unsigned char, kHeaderSize> bytes_{};
  std::size_t place_ = 0;
};

// Of a file with so much sound. Codecs other than PCM have a "fact" chunk, which counts the samples.
std::array<unsigned char, kHeaderSize> wave_header(std::uint64_t sound) {
  constexpr std::uint64_t kMost = 0xFFFFFFFF - kHeaderSize;
  const auto size = static_cast<std::uint32_t>(std::min(sound, kMost));
  HeaderWriter header;
  header.text("RIFF");
  header.number(static_cast<std::uint32_t>(kHeaderSize - 8 + size + size % 2), 4);
  header.text("WAVEfmt ");
  header.number(kFormatSize, 4);
  header.number(kMuLaw, 2);
  header.number(1, 2);  // channel
  header.number(kSampleRate, 4);
  header.number(kSampleRate, 4);  // bytes a second
  header.number(1, 2);            // bytes a sample
  header.number(8, 2);            // bits a sample
  header.number(0, 2);
  header.text("fact");
  header.number(4, 4);
  header.number(size, 4);
  header.text("data");
  header.number(size, 4);
  return header.bytes();
}

}  // namespace

SoundFormat sound_format_of(const std::string& file) {
  return has_extension(file, ".wav") ? SoundFormat::kWave : SoundFormat::kRaw;
}

std::optional<Problem> SoundFile::write(const unsigned char* sound, std::size_t length) {
  if (bytes_ == 0 && format_ == SoundFormat::kWave) {
    const auto header = wave_header(0);
    if (auto problem = file_.write(header.data(), header.size())) return problem;
  }
  bytes_ += length;
  return file_.write(sound, length);
}

std::optional<Problem> SoundFile::close() {
  if (bytes_ > 0 && format_ == SoundFormat::kWave) {
    const unsigned char padding = 0;
    if (bytes_ % 2 != 0) {
      if (auto problem = file_.write(&padding, 1)) return problem;
    }
    const auto header = wave_header(bytes_);
    if (auto problem = file_.overwrite(0, header.data(), header.size())) return problem;
  }
  return file_.close();
}

}  // namespace vexa::host
