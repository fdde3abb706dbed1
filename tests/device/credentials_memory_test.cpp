// SPDX-License-Identifier: Apache-2.0
// Where a password stands: in the memory of a driver that lives, and nowhere else. The camera is a process of its own,
// as it knows the password too. A sanitized build keeps memory that was given back, and maps more than can be read.
#if !defined(__SANITIZE_ADDRESS__) && !defined(__SANITIZE_THREAD__)

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstdint>
#include <cstring>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "runtime/base/base64.h"
#include "runtime/base/wipe.h"
#include "tests/support/own_address.h"
#include "tests/support/process_state.h"
#include "tests/support/temporary_folder.h"
#include "vexa/trace.h"
#include "vexa/vexa_common.h"
#include "virtual_camera/virtual_camera.h"

namespace vexa {
namespace {

constexpr char kUser[] = "operator";

/// A text that this object alone remembers, and not as it is: looking for it does not find the one who looks.
class PlantedText {
 public:
  explicit PlantedText(std::string& text) {
    for (const char letter : text) hidden_.push_back(static_cast<char>(letter ^ kMask));
    wipe(text);
  }

  [[nodiscard]] bool is_at(const char* bytes) const {
    for (std::size_t i = 0; i < hidden_.size(); ++i) {
      if ((bytes[i] ^ kMask) != hidden_[i]) return false;
    }
    return true;
  }
  [[nodiscard]] std::size_t size() const { return hidden_.size(); }
  [[nodiscard]] std::size_t count_in(const char* bytes, std::size_t length) const {
    std::size_t found = 0;
    const char* const last = length < size() ? bytes : bytes + (length - size()) + 1;
    const auto next = [this, last](const char* from) {
      return static_cast<const char*>(std::memchr(from, hidden_[0] ^ kMask, static_cast<std::size_t>(last - from)));
    };
    for (const char* at = next(bytes); at != nullptr; at = next(at + 1)) found += is_at(at) ? 1 : 0;
    return found;
  }
  [[nodiscard]] std::string plain() const {
    std::string text = hidden_;
    for (char& letter : text) letter = static_cast<char>(letter ^ kMask);
    return text;
  }

 private:
  static constexpr char kMask = 0x5a;
  std::string hidden_;
};

/// How often a text stands in what this process can write.
std::size_t count_in_memory(const PlantedText& text) {
  std::size_t found = 0;
  std::ifstream maps("/proc/self/maps");
  std::string line;
  std::vector<std::pair<std::uintptr_t, std::uintptr_t>> regions;
  while (std::getline(maps, line)) {
    std::uintptr_t begin = 0;
    std::uintptr_t end = 0;
    char dash = 0;
    std::string rights;
    std::istringstream(line) >> std::hex >> begin >> dash >> end >> rights;
    if (rights.starts_with("rw") && line.find("[v") == std::string::npos) regions.emplace_back(begin, end);
  }
  for (const auto& [begin, end] : regions) {
    found += text.count_in(reinterpret_cast<const char*>(begin), static_cast<std::size_t>(end - begin));
  }
  return found;
}

/// A camera in another process, which ends with this object.
class OtherProcessesCamera {
 public:
  explicit OtherProcessesCamera(const PlantedText& password) : address_(vexa_test::own_loopback(1)) {
    int ends[2];
    EXPECT_EQ(pipe(ends), 0);
    process_ = fork();
    if (process_ == 0) serve(ends[1], password);
    close(ends[1]);
    EXPECT_EQ(read(ends[0], &port_, sizeof port_), static_cast<ssize_t>(sizeof port_));
    close(ends[0]);
  }
  ~OtherProcessesCamera() {
    kill(process_, SIGKILL);
    waitpid(process_, nullptr, 0);
  }
  OtherProcessesCamera(const OtherProcessesCamera&) = delete;
  OtherProcessesCamera& operator=(const OtherProcessesCamera&) = delete;

  [[nodiscard]] const std::string& address() const { return address_; }
  [[nodiscard]] int port() const { return port_; }

 private:
  [[noreturn]] void serve(int end, const PlantedText& password) const {
    prctl(PR_SET_PDEATHSIG, SIGKILL);  // also when the test is killed
    camera::CameraOptions options;
    options.address = address_;
    options.user = kUser;
    options.password = password.plain();
    options.clip_path = VEXA_CLIPS "/small.h264";
    camera::VirtualCamera camera(options);
    const int port = camera.start() ? camera.http_port() : 0;
    if (write(end, &port, sizeof port) != static_cast<ssize_t>(sizeof port)) _exit(1);
    for (;;) pause();
  }

  const std::string address_;
  pid_t process_ = -1;
  int port_ = 0;
};

/// Of the password, and of the credentials as they travel: the parts that nothing else has.
struct Secrets {
  // 45 bytes; made here, so that it stands in no file. With the user name and the colon before it, 54 bytes are whole
  // groups of Base64, so that "as sent" is a part of the request whatever stands before it.
  static std::string made() {
    std::string text;
    std::uint32_t state = static_cast<std::uint32_t>(getpid());
    while (text.size() < 45) {
      state = state * 1664525 + 1013904223;
      text += static_cast<char>('a' + (state >> 24) % 26);
    }
    return text;
  }
  static std::string as_sent(const std::string& password) {
    std::string joined = std::string(kUser) + ":" + password;
    const WipedAtEnd wiped(joined);
    std::string encoded = base64_encode(joined);
    const WipedAtEnd wiped_too(encoded);
    return encoded.substr(16, 32);
  }
};

class CredentialsInMemory : public testing::Test {
 protected:
  CredentialsInMemory()
      : password_([] {
          std::string text = Secrets::made();
          return PlantedText(text);
        }()),
        sent_([this] {
          std::string plain = password_.plain();
          const WipedAtEnd wiped(plain);
          std::string text = Secrets::as_sent(plain);
          return PlantedText(text);
        }()) {}

  void connect(CVexaCommon& driver, const OtherProcessesCamera& camera) const {
    SLibDConnectionInfo connection;
    connection.streamTransport = 1;
    connection.host = camera.address();
    connection.port = camera.port();
    connection.timeout = 20000;
    connection.userName = kUser;
    connection.password = password_.plain();
    EXPECT_EQ(driver.SetCurrentConnectionInfo(connection), LIBD_OK);
    wipe(connection.password);
  }
  [[nodiscard]] bool holds(const std::string& text) const {
    return password_.count_in(text.data(), text.size()) + sent_.count_in(text.data(), text.size()) != 0;
  }

  const PlantedText password_;
  const PlantedText sent_;
};

TEST_F(CredentialsInMemory, AreGoneWithTheDriverAndInNoTextOfIt) {
  const OtherProcessesCamera camera(password_);
  ASSERT_NE(camera.port(), 0);
  const vexa_test::TemporaryFolder folder;
  const std::string log = folder.path() + "/cgi.log";
  std::string texts;
  {
    CVexaCommon driver;
    ASSERT_TRUE(SetTrace(driver, [&texts](const char* line) { texts += line; }));
    driver.SetCGILogPath(log.c_str());
    driver.SetCGILogLevel(true);
    connect(driver, camera);
    SLibDCameraInfo info;
    ASSERT_EQ(driver.GetCameraInfo(info), LIBD_OK);
    ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
    EXPECT_GT(count_in_memory(password_), 0U) << "a driver that lives has the password, and it is found";
    EXPECT_GT(count_in_memory(sent_), 0U);
    ASSERT_EQ(driver.StopVideoStreaming(), LIBD_OK);
    SLibDPinInfo pin;
    pin.number = -1;
    driver.SetOutput(pin);
    std::string error;
    driver.GetLatestErrorText(error);
    texts += error;
  }
  EXPECT_EQ(count_in_memory(password_), 0U);
  EXPECT_EQ(count_in_memory(sent_), 0U);
  EXPECT_FALSE(holds(texts)) << "trace and errors";
  std::ifstream file(log);
  EXPECT_FALSE(holds(std::string(std::istreambuf_iterator<char>(file), {})));
}

TEST_F(CredentialsInMemory, AreReplacedWithoutATrace) {
  const OtherProcessesCamera camera(password_);
  CVexaCommon driver;
  driver.SetCGILogPath("/dev/null");
  connect(driver, camera);
  SLibDSystemInfo system;
  ASSERT_EQ(driver.GetCurrentSystemInfo(system), LIBD_OK);
  ASSERT_GT(count_in_memory(password_), 0U);
  SLibDConnectionInfo other;
  other.host = camera.address();
  ASSERT_EQ(driver.SetCurrentConnectionInfo(other), LIBD_OK);
  EXPECT_EQ(count_in_memory(password_), 0U);
  EXPECT_EQ(count_in_memory(sent_), 0U);
}

}  // namespace
}  // namespace vexa

#endif
