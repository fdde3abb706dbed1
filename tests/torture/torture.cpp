// Makes each fallible call of each scenario fail, the first, the second, and so on until none is left: once, and from
// then on. After each the driver has to answer with a stated code, do its whole work again, and leave no descriptor,
// thread or byte.
//   torture CAMERA_PROGRAM [--scenario NAME] [--function NAME] [--one-in N --seed S]
// Runs with libvexa_torture_calls.so loaded before all others (scripts/torture does that).
#include <dirent.h>
#include <dlfcn.h>
#include <fcntl.h>
#include <malloc.h>
#include <netdb.h>
#include <poll.h>
#include <signal.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <memory>
#include <new>
#include <random>
#include <string>
#include <string_view>
#include <vector>

#include "tests/torture/fault_control.h"
#include "vexa/file_logger.h"
#include "vexa/models.h"
#include "vexa/runtime.h"

namespace vexa::torture {
namespace {

using Clock = std::chrono::steady_clock;

constexpr std::chrono::seconds kLongestRun{20};
constexpr std::chrono::seconds kLongestWait{3};
constexpr unsigned long kStillActive = 259;
constexpr int kCameraTimeout = 1000;  // milliseconds
constexpr const char* kCamera = "127.0.0.2";

struct FaultRow {
  const char* name;
  Function function;
  Kind kind;
  int error;
  bool lasts;  // is also tried from one call on
};

constexpr FaultRow kFaults[] = {
    {"malloc", Function::kAllocate, Kind::kError, ENOMEM, true},
    {"socket", Function::kSocket, Kind::kError, EMFILE, true},
    {"connect", Function::kConnect, Kind::kError, ENETUNREACH, true},
    {"bind", Function::kBind, Kind::kError, EADDRINUSE, true},
    {"setsockopt", Function::kSetsockopt, Kind::kError, ENOBUFS, true},
    {"fcntl", Function::kFcntl, Kind::kError, EINVAL, true},
    {"poll", Function::kPoll, Kind::kError, ENOMEM, true},
    {"poll-interrupted", Function::kPoll, Kind::kError, EINTR, false},
    {"send", Function::kSend, Kind::kError, EPIPE, true},
    {"send-short", Function::kSend, Kind::kShort, 0, true},
    {"send-interrupted", Function::kSend, Kind::kError, EINTR, false},
    {"send-full", Function::kSend, Kind::kError, EAGAIN, false},
    {"recv", Function::kReceive, Kind::kError, ECONNRESET, true},
    {"recv-short", Function::kReceive, Kind::kShort, 0, false},
    {"recv-interrupted", Function::kReceive, Kind::kError, EINTR, false},
    {"recv-empty", Function::kReceive, Kind::kError, EAGAIN, false},
    {"pipe2", Function::kPipe, Kind::kError, EMFILE, true},
    {"eventfd", Function::kEventfd, Kind::kError, EMFILE, true},
    {"pthread_create", Function::kThread, Kind::kError, EAGAIN, true},
    {"open", Function::kOpen, Kind::kError, EMFILE, true},
    {"read", Function::kRead, Kind::kError, EIO, true},
    {"read-short", Function::kRead, Kind::kShort, 0, false},
    {"write", Function::kWrite, Kind::kError, ENOSPC, true},
    {"write-short", Function::kWrite, Kind::kShort, 0, false},
    {"rename", Function::kRename, Kind::kError, EACCES, true},
    {"fsync", Function::kSync, Kind::kError, EIO, true},
    {"getaddrinfo", Function::kResolve, Kind::kError, EAI_AGAIN, true},
};

// What one run of a scenario came to: the first code that is none of a success, and the first that no contract states.
struct Outcome {
  const char* step = nullptr;
  long code = LIBD_OK;
  bool unstated = false;
};

// Collects the codes of one run. Allocates nothing, as allocations may be failing.
class Run {
 public:
  // A success is LIBD_OK, or no frame yet.
  void expect(const char* step, ELibDReturnCode code) {
    if (code == LIBD_OK || outcome_.unstated) return;
    switch (code) {
      case LIBD_OK:
        return;
      case LIBD_FAILED:
      case LIBD_STREAM_OPEN_FAILED:
      case LIBD_TIMEOUT:
      case LIBD_UNAUTHORIZED:
      case LIBD_NO_FRAME:
      case LIBD_FRAME_DAMAGED:
      case LIBD_BUFFER_TOO_SMALL:
        break;
      case LIBD_NOT_SUPPORTED:
      case LIBD_INVALID_ARGUMENT:
      case LIBD_INVALID_MODE:
        outcome_.unstated = true;
        break;
    }
    if (outcome_.step == nullptr || outcome_.unstated) {
      outcome_.step = step;
      outcome_.code = code;
    }
  }

  void expect_true(const char* step, bool success) {
    if (!success) expect(step, LIBD_FAILED);
  }

  [[nodiscard]] const Outcome& outcome() const { return outcome_; }

 private:
  Outcome outcome_;
};

struct CountingSink : CDataSink {
  void Write(const unsigned char*, unsigned int) override { ++frames; }
  int frames = 0;
};

// Takes frames until three have come or the stream ends.
void take_frames(Run& run, CLibraryDevice& driver) {
  CountingSink sink;
  SLibDVideoFrameInfo frame;
  frame.sink = &sink;
  const auto deadline = Clock::now() + kLongestWait;
  ELibDReturnCode code = LIBD_NO_FRAME;
  while (sink.frames < 3 && Clock::now() < deadline && (code == LIBD_OK || code == LIBD_NO_FRAME)) {
    code = driver.GetCurrentVideoFrame(frame);
    if (code == LIBD_NO_FRAME) poll(nullptr, 0, 3);
  }
  run.expect("frames", sink.frames >= 3 ? LIBD_OK : code);
}

void connect(Run& run, CLibraryDevice& driver, int transport) {
  SLibDConnectionInfo connection;
  connection.host = kCamera;
  connection.port = 80;
  connection.streamTransport = transport;
  connection.timeout = kCameraTimeout;
  connection.userName = "admin";
  connection.password = "admin";
  run.expect("SetCurrentConnectionInfo", driver.SetCurrentConnectionInfo(connection));
}

void inquire(Run& run, CLibraryDevice& driver) {
  connect(run, driver, 1);
  SLibDSystemInfo system;
  run.expect("GetCurrentSystemInfo", driver.GetCurrentSystemInfo(system));
  SLibDCameraInfo camera;
  camera.streamNumber = 1;
  run.expect("GetCameraInfo", driver.GetCameraInfo(camera));
  run.expect("SetCameraInfo", driver.SetCameraInfo(camera));
  SLibDIoBoxInfo pins;
  run.expect("GetIoBoxInfo", driver.GetIoBoxInfo(pins));
}

void set(Run& run, CLibraryDevice& driver) {
  connect(run, driver, 1);
  ELibDDayNightType mode{};
  run.expect("GetDayNightMode", driver.GetDayNightMode(mode));
  run.expect("PanTilt", driver.PanTilt(2000, 0));
  run.expect("PanTilt stop", driver.PanTilt(0, 0));
  run.expect("Zoom", driver.Zoom(0));
  SLibDPresetInfo preset;
  preset.index = 0;
  preset.name = "gate";
  run.expect("SetPreset", driver.SetPreset(preset));
  std::vector<SLibDPresetInfo> presets;
  run.expect("GetPresets", driver.GetPresets(presets));
  run.expect("RecallPreset", driver.RecallPreset(0));
}

void stream(Run& run, CLibraryDevice& driver, int transport) {
  connect(run, driver, transport);
  SLibDCameraInfo camera;
  camera.streamNumber = 1;
  run.expect("GetCameraInfo", driver.GetCameraInfo(camera));
  const ELibDReturnCode started = driver.StartVideoStreaming();
  run.expect("StartVideoStreaming", started);
  if (started == LIBD_OK) take_frames(run, driver);
  run.expect("StopVideoStreaming", driver.StopVideoStreaming());
}

void rtp(Run& run, CLibraryDevice& driver) { stream(run, driver, 1); }
void http(Run& run, CLibraryDevice& driver) { stream(run, driver, 0); }

void polled(Run& run, CLibraryDevice& driver) {
  connect(run, driver, 1);
  run.expect("StartIoStreaming", driver.StartIoStreaming());
  std::vector<SLibDPinInfo> pins;
  const ELibDReturnCode status = driver.GetCurrentIoStatus(pins);
  run.expect("GetCurrentIoStatus", status == LIBD_NO_FRAME ? LIBD_OK : status);
  run.expect("StopIoStreaming", driver.StopIoStreaming());
  run.expect("StartModRawData", driver.StartModRawData());
  run.expect("StopModRawData", driver.StopModRawData());
}

void card(Run& run, CLibraryDevice& driver) {
  connect(run, driver, 1);
  SLibDEdgeStorageMode mode;
  run.expect("GetEdgeStorageMode", driver.GetEdgeStorageMode(mode));
  SLibDEdgeStorageRecordList list;
  run.expect("GetEdgeStorageRecordList", driver.GetEdgeStorageRecordList(list));
}

void runtime_layer(Run& run, CLibraryDevice&) {
  typedHandle* const event = CreateEvent(nullptr, 1, 0, nullptr);
  run.expect_true("CreateEvent", event != nullptr);
  if (event != nullptr) {
    run.expect_true("SetEvent", SetEvent(event) != 0);
    run.expect_true("WaitForSingleObject", WaitForSingleObject(event, 100) == 0);
    CloseHandle(event);
  }
  typedHandle* const thread = _beginthreadex(
      nullptr, 0, [](void*) -> unsigned { return 7; }, nullptr, 0, nullptr);
  run.expect_true("_beginthreadex", thread != nullptr);
  if (thread != nullptr) {
    unsigned long code = kStillActive;
    const auto deadline = Clock::now() + kLongestWait;
    while (code == kStillActive && Clock::now() < deadline && GetExitCodeThread(thread, &code) != 0)
      poll(nullptr, 0, 1);
    run.expect_true("GetExitCodeThread", code == 7);
    CloseHandle(thread);
  }
  typedHandle* const file = CreateFile("torture.tmp", GENERIC_WRITE, 0, nullptr, CREATE_ALWAYS, 0, nullptr);
  run.expect_true("CreateFile", file != nullptr);
  if (file != nullptr) {
    unsigned long written = 0;
    run.expect_true("WriteFile", WriteFile(file, "text", 4, &written, nullptr) != 0 && written == 4);
    CloseHandle(file);
  }
  run.expect_true("DeleteFile", DeleteFile("torture.tmp") != 0);
}

void logger(Run& run, CLibraryDevice& driver) {
  run.expect("SetCGILogPath", driver.SetCGILogPath("torture.log"));
  run.expect("SetCGILogLevel", driver.SetCGILogLevel(true));
  inquire(run, driver);
  run.expect("SetCGILogLevel off", driver.SetCGILogLevel(false));
}

struct Scenario {
  const char* name;
  void (*body)(Run&, CLibraryDevice&);
};

constexpr Scenario kScenarios[] = {
    {"inquire", inquire},       {"set", set},       {"rtp", rtp}, {"http", http}, {"polled", polled}, {"card", card},
    {"runtime", runtime_layer}, {"logger", logger},
};

int entries_of(const char* folder) {
  DIR* const open = opendir(folder);
  if (open == nullptr) return -1;
  int count = 0;
  while (readdir(open) != nullptr) ++count;
  closedir(open);
  return count;
}

// What a process holds; the same after a run as before.
struct Held {
  int descriptors = entries_of("/proc/self/fd");
  int threads = entries_of("/proc/self/task");
  std::size_t bytes = mallinfo2().uordblks;
};

// Threads that have ended leave /proc a moment later.
Held settled(int threads) {
  const auto deadline = Clock::now() + std::chrono::seconds(2);
  Held held;
  while (held.threads > threads && Clock::now() < deadline) {
    poll(nullptr, 0, 2);
    held = Held();
  }
  return held;
}

class Camera {
 public:
  explicit Camera(const char* program) {
    int ends[2];
    if (pipe2(ends, O_CLOEXEC) != 0) return;
    process_ = fork();
    if (process_ == 0) {
      prctl(PR_SET_PDEATHSIG, SIGTERM);
      dup2(ends[1], STDOUT_FILENO);
      unsetenv("LD_PRELOAD");
      execl(program, program, "--address", kCamera, "--profile", VEXA_SOURCE_DIR "/models/profiles/LMX-P200.json",
            "--drawn", "--card", "16", static_cast<char*>(nullptr));
      _exit(127);
    }
    close(ends[1]);
    char line[256];
    ready_ = ::read(ends[0], line, sizeof(line)) > 0;
    close(ends[0]);
  }
  Camera(const Camera&) = delete;
  Camera& operator=(const Camera&) = delete;
  ~Camera() {
    if (process_ <= 0) return;
    kill(process_, SIGTERM);
    waitpid(process_, nullptr, 0);
  }
  [[nodiscard]] bool ready() const { return ready_; }

 private:
  pid_t process_ = -1;
  bool ready_ = false;
};

struct Options {
  const char* camera = nullptr;
  std::string scenario, function;
  std::uint64_t one_in = 1, seed = 1;
};

class Torture {
 public:
  explicit Torture(const Options& options) : options_(options), choose_(options.seed) {}

  bool run() {
    if (ProfileError error; !LoadProfile(VEXA_SOURCE_DIR "/models/profiles/LMX-P200.json", profile_, error)) {
      std::fprintf(stderr, "torture: %s\n", error.Message().c_str());
      return false;
    }
    for (const Scenario& scenario : kScenarios) {
      if (!options_.scenario.empty() && options_.scenario != scenario.name) continue;
      for (const FaultRow& row : kFaults) {
        if (options_.function.empty() || options_.function == row.name) try_row(scenario, row);
      }
    }
    std::printf("%llu faults, %d findings\n", static_cast<unsigned long long>(faults_), findings_);
    return findings_ == 0 && faults_ > 0;
  }

 private:
  // Runs the scenario and destroys its driver under the fault; the calls counted.
  std::uint64_t run_faulted(const Scenario& scenario, const Fault& fault, Outcome& outcome) {
    Run run;
    auto driver = MakeDevice(profile_);
    vexa_torture_arm(&fault);
    scenario.body(run, *driver);
    const std::uint64_t calls = vexa_torture_disarm();
    outcome = run.outcome();
    // The driver is usable again.
    Run again;
    driver->StopVideoStreaming();
    scenario.body(again, *driver);
    if (again.outcome().step != nullptr) {
      std::string text;
      driver->GetLatestErrorText(text);
      report("is not usable again", again.outcome());
      std::printf("      %s\n", text.c_str());
    }
    // And ends while the fault lasts.
    vexa_torture_arm(&fault);
    driver.reset();
    vexa_torture_disarm();
    return calls;
  }

  void try_row(const Scenario& scenario, const FaultRow& row) {
    name_ = std::string(scenario.name) + "." + row.name;
    Outcome outcome;
    const std::uint64_t calls = run_faulted(scenario, {row.function, row.kind, row.error, 0, 0}, outcome);
    if (outcome.step != nullptr) {
      at_ = 0;
      report("fails without a fault", outcome);
      return;
    }
    for (int forever = 0; forever <= (row.lasts ? 1 : 0); ++forever) {
      for (at_ = 1; at_ <= calls; ++at_) {
        if (options_.one_in > 1 && choose_() % options_.one_in != 0) continue;
        forever_ = forever;
        try_fault(scenario, {row.function, row.kind, row.error, forever, at_});
      }
    }
    std::printf("%-28s %5llu calls\n", name_.c_str(), static_cast<unsigned long long>(calls));
    std::fflush(stdout);
  }

  void try_fault(const Scenario& scenario, const Fault& fault) {
    const Held before = settled(0);
    const auto began = Clock::now();
    Outcome outcome;
    ++faults_;
    run_faulted(scenario, fault, outcome);
    if (outcome.unstated) report("answers with a code that is not stated", outcome);
    if (Clock::now() - began > kLongestRun) report("takes too long", outcome);
    const Held after = settled(before.threads);
    if (after.descriptors != before.descriptors) note("descriptors", after.descriptors - before.descriptors);
    if (after.threads != before.threads) note("threads", after.threads - before.threads);
    // The C library keeps what it has made once, hence only the second time counts.
    if (after.bytes > before.bytes) {
      run_faulted(scenario, fault, outcome);
      const Held second = settled(before.threads);
      if (second.bytes > after.bytes) note("bytes", static_cast<long>(second.bytes - after.bytes));
    }
  }

  void report(const char* what, const Outcome& outcome) {
    ++findings_;
    std::printf("FOUND %s call %llu%s: %s (%s: %ld)\n", name_.c_str(), static_cast<unsigned long long>(at_),
                forever_ != 0 ? " and all later ones" : "", what, outcome.step == nullptr ? "-" : outcome.step,
                outcome.code);
  }

  void note(const char* what, long number) {
    ++findings_;
    std::printf("FOUND %s call %llu%s: leaves %ld %s\n", name_.c_str(), static_cast<unsigned long long>(at_),
                forever_ != 0 ? " and all later ones" : "", number, what);
  }

  Options options_;
  std::mt19937_64 choose_;
  Profile profile_;
  std::string name_;
  std::uint64_t at_ = 0, faults_ = 0;
  int forever_ = 0, findings_ = 0;
};

int usage() {
  std::fputs("usage: torture CAMERA_PROGRAM [--scenario NAME] [--function NAME] [--one-in N] [--seed S]\nscenarios:",
             stderr);
  for (const Scenario& scenario : kScenarios) std::fprintf(stderr, " %s", scenario.name);
  std::fputs("\nfunctions:", stderr);
  for (const FaultRow& row : kFaults) std::fprintf(stderr, " %s", row.name);
  std::fputs("\n", stderr);
  return 2;
}

}  // namespace
}  // namespace vexa::torture

int main(int argc, char** argv) {
  using namespace vexa::torture;
  Options options;
  if (argc < 2 || argc % 2 != 0) return usage();
  options.camera = argv[1];
  for (int i = 2; i + 1 < argc; i += 2) {
    const std::string_view name = argv[i];
    if (name == "--scenario") {
      options.scenario = argv[i + 1];
    } else if (name == "--function") {
      options.function = argv[i + 1];
    } else if (name == "--one-in") {
      options.one_in = std::max(1ULL, std::strtoull(argv[i + 1], nullptr, 10));
    } else if (name == "--seed") {
      options.seed = std::strtoull(argv[i + 1], nullptr, 10);
    } else {
      return usage();
    }
  }
  signal(SIGPIPE, SIG_DFL);  // a host that does not ignore it must live too
  const Camera camera(options.camera);
  if (!camera.ready()) {
    std::fprintf(stderr, "torture: %s did not start\n", options.camera);
    return 2;
  }
  return Torture(options).run() ? 0 : 1;
}
