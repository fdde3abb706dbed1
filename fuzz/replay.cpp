// SPDX-License-Identifier: Apache-2.0
// NAME_fuzz --replay FOLDER reads every file of the target's corpus, and every file cut short at every length. Each
// input lies right before a page that may not be touched, so that reading one byte too far ends the program.
#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <system_error>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

namespace {

// Cutting a file at every length costs the square of its size; longer files are cut at this many lengths.
constexpr std::size_t kCuts = 4096;

/// Memory with a forbidden page after it.
class GuardedMemory {
 public:
  explicit GuardedMemory(std::size_t capacity) : page_(static_cast<std::size_t>(sysconf(_SC_PAGESIZE))) {
    size_ = (capacity + page_ - 1) / page_ * page_ + page_;
    void* const memory = mmap(nullptr, size_, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (memory == MAP_FAILED) return;
    begin_ = static_cast<std::uint8_t*>(memory);
    ok_ = mprotect(begin_ + size_ - page_, page_, PROT_NONE) == 0;
  }
  ~GuardedMemory() {
    if (begin_ != nullptr) munmap(begin_, size_);
  }
  GuardedMemory(const GuardedMemory&) = delete;
  GuardedMemory& operator=(const GuardedMemory&) = delete;

  bool ok() const { return ok_; }

  /// Puts `length` bytes right before the forbidden page.
  const std::uint8_t* place(const char* bytes, std::size_t length) {
    std::uint8_t* const target = begin_ + size_ - page_ - length;
    std::copy_n(bytes, length, target);
    return target;
  }

 private:
  std::size_t page_;
  std::size_t size_ = 0;
  std::uint8_t* begin_ = nullptr;
  bool ok_ = false;
};

bool replay(const std::filesystem::path& path, std::size_t& inputs) {
  std::ifstream file(path, std::ios::binary);
  const std::vector<char> bytes{std::istreambuf_iterator<char>(file), {}};
  GuardedMemory memory(bytes.size());
  if (!memory.ok() || file.bad()) return false;
  const std::size_t step = bytes.size() / kCuts + 1;
  for (std::size_t length = 0; length < bytes.size(); length += step, ++inputs) {
    LLVMFuzzerTestOneInput(memory.place(bytes.data(), length), length);
  }
  LLVMFuzzerTestOneInput(memory.place(bytes.data(), bytes.size()), bytes.size());
  ++inputs;
  return true;
}

int replay_all(const char* folder) {
  std::error_code failure;
  std::size_t files = 0;
  std::size_t inputs = 0;
  for (const auto& entry : std::filesystem::directory_iterator(folder, failure)) {
    if (!replay(entry.path(), inputs)) {
      std::fprintf(stderr, "%s cannot be replayed\n", entry.path().c_str());
      return 1;
    }
    ++files;
  }
  std::printf("%zu files, %zu inputs\n", files, inputs);
  return files == 0 ? 1 : 0;
}

}  // namespace

// libFuzzer's call before it reads its options.
extern "C" int LLVMFuzzerInitialize(int* count, char*** arguments);
extern "C" int LLVMFuzzerInitialize(int* count, char*** arguments) {
  if (*count == 3 && std::strcmp((*arguments)[1], "--replay") == 0) std::exit(replay_all((*arguments)[2]));
  return 0;
}
