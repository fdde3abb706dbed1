// SPDX-License-Identifier: Apache-2.0
// A folder of a test's own, gone with everything in it when the test ends.
#pragma once

#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <stdexcept>
#include <string>

namespace vexa_test {

/// Where files are held in memory, for tests that make many of them; the ordinary place when there is none.
inline std::string memory_folder() {
  return access("/dev/shm", W_OK) == 0 ? "/dev/shm" : std::filesystem::temp_directory_path().string();
}

class TemporaryFolder {
 public:
  explicit TemporaryFolder(const std::string& parent = std::filesystem::temp_directory_path()) {
    std::string name = parent + "/vexa-test-XXXXXX";
    if (mkdtemp(name.data()) == nullptr) throw std::runtime_error("no folder for the test in " + parent);
    path_ = std::filesystem::canonical(name);
  }
  ~TemporaryFolder() {
    std::error_code ignored;
    std::filesystem::remove_all(path_, ignored);
  }
  TemporaryFolder(const TemporaryFolder&) = delete;
  TemporaryFolder& operator=(const TemporaryFolder&) = delete;

  const std::string& path() const { return path_; }

  /// The path of `name` in the folder.
  std::string operator/(const std::string& name) const { return path_ + "/" + name; }

  /// Makes a file, and returns its path.
  std::string make_file(const std::string& name, const std::string& contents = "") const {
    std::ofstream(*this / name, std::ios::binary) << contents;
    return *this / name;
  }

  /// Makes a folder with its parents, and returns its path.
  std::string make_folder(const std::string& name) const {
    std::filesystem::create_directories(*this / name);
    return *this / name;
  }

 private:
  std::string path_;
};

inline bool is_there(const std::string& path) { return access(path.c_str(), F_OK) == 0; }

/// The whole of a file; empty when it cannot be read.
inline std::string contents_of(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}

}  // namespace vexa_test
