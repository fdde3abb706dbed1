// What ffprobe makes of a file.
#pragma once

#include <cstdio>
#include <string>
#include <string_view>
#include <vector>

namespace vexa_test {

// What ffprobe reports about a file, line by line, without warnings.
inline std::vector<std::string> probed(const std::string& entries, const std::string& path) {
  std::vector<std::string> lines;
  const std::string command = "ffprobe -v warning -show_entries " + entries + " -of csv=p=0 '" + path + "' 2>&1";
  std::FILE* output = popen((command + " </dev/null").c_str(), "r");
  char line[128];
  while (output != nullptr && std::fgets(line, sizeof line, output) != nullptr) {
    lines.emplace_back(line, std::string_view(line).find('\n'));
  }
  if (output != nullptr) pclose(output);
  return lines;
}

}  // namespace vexa_test
