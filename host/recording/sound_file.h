// SPDX-License-Identifier: Apache-2.0
// The file that a camera's sound goes to.
#ifndef HOST_RECORDING_SOUND_FILE_H_
#define HOST_RECORDING_SOUND_FILE_H_

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

#include "host/recording/frame_file.h"

namespace vexa::host {

enum class SoundFormat { kRaw, kWave };

// ".wav", in capitals too, is a WAVE file of G.711 mu-law, 8000 samples a second, one channel; any other name is the
// sound as it came.
[[nodiscard]] SoundFormat sound_format_of(const std::string& file);

// Writes sound with the header that its format needs. Used on the command's thread; does not own the file.
class SoundFile {
 public:
  // `file` is opened with the first sound.
  SoundFile(FrameFile& file, SoundFormat format) : file_(file), format_(format) {}

  [[nodiscard]] std::optional<Problem> write(const unsigned char* sound, std::size_t length);
  // Writes the length into the WAVE header.
  [[nodiscard]] std::optional<Problem> close();
  [[nodiscard]] std::uint64_t bytes() const { return bytes_; }

 private:
  FrameFile& file_;
  const SoundFormat format_;
  std::uint64_t bytes_ = 0;
};

}  // namespace vexa::host

#endif  // HOST_RECORDING_SOUND_FILE_H_
