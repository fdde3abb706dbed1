// SPDX-License-Identifier: Apache-2.0
// A decoder that is not ours, as the last word on pictures.
#pragma once

#include <cstddef>
#include <cstdio>
#include <string>

namespace vexa_test {

struct Decoded {
  bool flawless = false;  ///< it met no damage
  bool silent = true;     ///< it printed no complaint
  std::size_t frames = 0;
  std::string size;  ///< for instance "640x480"
};

/// Decodes a file; `format` as ffmpeg calls it, for instance "h264".
inline Decoded decode(const std::string& path, const std::string& format) {
  const std::string command = "ffmpeg -v warning -nostdin -xerror -err_detect explode -f " + format + " -i '" + path +
                              "' -an -f framemd5 - 2>&1";
  Decoded decoded;
  std::FILE* output = popen(command.c_str(), "r");
  if (output == nullptr) return decoded;
  const std::string dimensions = "#dimensions 0: ";
  char piece[512];
  while (std::fgets(piece, sizeof piece, output) != nullptr) {
    const std::string line = piece;
    if (line.rfind(dimensions, 0) == 0)
      decoded.size = line.substr(dimensions.size(), line.find('\n') - dimensions.size());
    if (line.rfind("0,", 0) == 0) ++decoded.frames;
    decoded.silent = decoded.silent && (line[0] == '#' || line[0] == '0');
  }
  decoded.flawless = pclose(output) == 0;
  return decoded;
}

}  // namespace vexa_test
