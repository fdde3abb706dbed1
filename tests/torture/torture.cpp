// SPDX-License-Identifier: Apache-2.0
// Makes each fallible call of a scenario fail, the first, the second, and so on until none is left: once, and from then
// on. After each the driver has to answer with a stated code, do its whole work again, and leave no descriptor, thread
// or byte. Is linked so that libvexa_torture_calls.so comes before the C library; scripts/torture runs it.
#include <dirent.h>
#include <fcntl.h>
#include <malloc.h>
#include <netdb.h>
#include <poll.h>
#include <signal.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <random>
#include <string>
#include <string_view>

#include "tests/torture/camera_process.h"
#include "tests/torture/fault_control.h"
#include "tests/torture/scenarios.h"
#include "vexa/models.h"

namespace vexa::torture {
namespace {

using Clock = std::chrono::steady_clock;

constexpr int kRepetitions = 10;  // of what may have kept some bytes by chance, as a thread that has yet to end does
constexpr int kAttempts = 3;      // of what a busy machine may keep from succeeding
constexpr std::chrono::seconds kProgressInterval{10};

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
    {"getsockopt", Function::kSocketOption, Kind::kError, ENOBUFS, true},
    {"getsockname", Function::kSocketName, Kind::kError, ENOBUFS, true},
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
    {"epoll_create1", Function::kEpoll, Kind::kError, EMFILE, true},
    {"epoll_ctl", Function::kEpollAdd, Kind::kError, ENOSPC, true},
    {"timerfd_create", Function::kTimer, Kind::kError, EMFILE, true},
    {"pthread_create", Function::kThread, Kind::kError, EAGAIN, true},
    {"pthread_mutex_init", Function::kMutex, Kind::kError, EAGAIN, true},
    {"open", Function::kOpen, Kind::kError, EMFILE, true},
    {"read", Function::kRead, Kind::kError, EIO, true},
    {"read-short", Function::kRead, Kind::kShort, 0, false},
    {"write", Function::kWrite, Kind::kError, ENOSPC, true},
    {"write-short", Function::kWrite, Kind::kShort, 0, false},
    {"rename", Function::kRename, Kind::kError, EACCES, true},
    {"fsync", Function::kSync, Kind::kError, EIO, true},
    {"gethostbyname_r", Function::kResolve, Kind::kError, TRY_AGAIN, true},
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

// Threads that have ended leave /proc a moment later, and so do those that look up names.
Held settled(const Held& before) {
  const auto deadline = Clock::now() + std::chrono::seconds(2);
  Held held;
  while ((held.threads > before.threads || held.descriptors > before.descriptors) && Clock::now() < deadline) {
    poll(nullptr, 0, 2);
    held = Held();
  }
  return held;
}

struct Options {
  const char* camera = nullptr;
  std::string scenario, function;
  std::uint64_t one_in = 1, seed = 1;
  std::uint64_t call = 0;  // 0: all
  bool and_later = false;  // with `call`
  unsigned limit = 60;     // seconds, of one fault
};

// Where findings and progress go; the library traces to standard output.
int report_fd = STDOUT_FILENO;

// What is under way, for the handler of signals.
char under_way[160];

void write_text(const char* text) { [[maybe_unused]] const ssize_t written = write(report_fd, text, strlen(text)); }

void ended_by(int number) {
  write_text("FOUND ");
  write_text(under_way);
  write_text(number == SIGALRM ? ": hangs\n" : ": ends the process\n");
  _exit(1);
}

// Runs one scenario under one kind of fault.
class Row {
 public:
  Row(const Scenario& scenario, const FaultRow& fault, const Profile& profile, const Options& options)
      : scenario_(scenario), fault_(fault), profile_(profile), options_(options) {}

  // False when the scenario fails without a fault.
  bool run(std::mt19937_64& choose) {
    if (!runs_without_fault()) return false;
    began_ = reported_ = Clock::now();
    for (int lasting = 0; lasting <= (fault_.lasts ? 1 : 0); ++lasting) {
      for (std::uint64_t at = 1; at <= std::max(calls_, options_.call); ++at) {
        if (options_.call != 0 && (at != options_.call || options_.and_later != (lasting != 0))) continue;
        if (options_.call == 0 && choose() % options_.one_in != 0) continue;
        try_fault(at, lasting);
        report_progress(at, lasting);
      }
    }
    if (calls_ != 0) {
      dprintf(report_fd, "%-30s %5llu calls, %5llu faults, %d found, %.1f s\n", name().c_str(), as_long(calls_),
              as_long(faults_), findings_, seconds_since(began_));
    }
    return true;
  }

  [[nodiscard]] std::uint64_t faults() const { return faults_; }
  [[nodiscard]] int findings() const { return findings_; }

 private:
  static unsigned long long as_long(std::uint64_t number) { return number; }
  static double seconds_since(Clock::time_point then) {
    return std::chrono::duration<double>(Clock::now() - then).count();
  }

  [[nodiscard]] std::string name() const { return std::string(scenario_.name) + "." + fault_.name; }
  [[nodiscard]] Fault fault(std::uint64_t at, int lasting) const {
    return {fault_.function, fault_.kind, fault_.error, lasting, at};
  }

  // Counts the calls of a run that goes well.
  bool runs_without_fault() {
    std::snprintf(under_way, sizeof(under_way), "%s without a fault", name().c_str());
    Outcome outcome;
    for (int attempt = 0; attempt < kAttempts; ++attempt) {
      if (run_once(fault(0, 0), outcome); outcome.step == nullptr) return true;
    }
    report("fails", outcome);
    return false;
  }

  // Runs the scenario and destroys its driver under the fault.
  void run_once(const Fault& fault, Outcome& outcome) {
    Run run;
    auto driver = MakeDevice(profile_);
    alarm(options_.limit);
    vexa_torture_arm(&fault);
    scenario_.body(run, *driver);
    const std::uint64_t calls = vexa_torture_disarm();
    if (fault.at == 0) calls_ = calls;
    outcome = run.outcome();
    if (fault.at != 0) use_again(*driver);
    vexa_torture_arm(&fault);
    driver.reset();
    vexa_torture_disarm();
    alarm(0);
  }

  void use_again(CLibraryDevice& driver) {
    Outcome outcome;
    for (int attempt = 0; attempt < kAttempts; ++attempt) {
      Run again;
      driver.StopVideoStreaming();
      scenario_.body(again, driver);
      outcome = again.outcome();
      if (outcome.step == nullptr) return;
    }
    std::string text;
    driver.GetLatestErrorText(text);
    report("is not usable again", outcome);
    dprintf(report_fd, "      %s\n", text.c_str());
  }

  void try_fault(std::uint64_t at, int lasting) {
    std::snprintf(under_way, sizeof(under_way), "%s: --scenario %s --function %s --call %llu%s", name().c_str(),
                  scenario_.name, fault_.name, as_long(at), lasting != 0 ? "+" : "");
    const Held before;
    Outcome outcome;
    ++faults_;
    run_once(fault(at, lasting), outcome);
    if (outcome.unstated) report("answers with a code that is not stated", outcome);
    const Held after = settled(before);
    const int found = findings_;
    if (after.descriptors > before.descriptors) note_left(after.descriptors - before.descriptors, "descriptors");
    if (after.threads > before.threads) note_left(after.threads - before.threads, "threads");
    // What holds the bytes of a thread that is left is known then.
    if (after.bytes > before.bytes && findings_ == found) compare_bytes(fault(at, lasting), after);
  }

  // The C library and the scenario keep what they have made once: only what grows with each run counts.
  void compare_bytes(const Fault& fault, Held held) {
    std::size_t grown = 0;
    for (int repetition = 0; repetition < kRepetitions; ++repetition) {
      Outcome outcome;
      run_once(fault, outcome);
      const Held now = settled(held);
      if (now.bytes <= held.bytes) return;
      grown = now.bytes - held.bytes;
      held = now;
    }
    note_left(static_cast<long>(grown), "bytes");
  }

  void report(const char* what, const Outcome& outcome) {
    ++findings_;
    dprintf(report_fd, "FOUND %s: %s (%s: code %ld)\n", under_way, what, outcome.step == nullptr ? "-" : outcome.step,
            outcome.code);
  }

  void note_left(long number, const char* what) {
    ++findings_;
    dprintf(report_fd, "FOUND %s: leaves %ld %s\n", under_way, number, what);
  }

  void report_progress(std::uint64_t at, int lasting) {
    if (Clock::now() - reported_ < kProgressInterval) return;
    reported_ = Clock::now();
    dprintf(report_fd, "%-30s at call %llu%s of %llu\n", name().c_str(), as_long(at), lasting != 0 ? "+" : "",
            as_long(calls_));
  }

  const Scenario& scenario_;
  const FaultRow& fault_;
  const Profile& profile_;
  const Options& options_;
  std::uint64_t calls_ = 0, faults_ = 0;
  int findings_ = 0;
  Clock::time_point began_, reported_;
};

const Scenario* find(const std::vector<Scenario>& scenarios, const std::string& name) {
  const auto found =
      std::find_if(scenarios.begin(), scenarios.end(), [&](const Scenario& s) { return s.name == name; });
  return found == scenarios.end() ? nullptr : &*found;
}

// 0: nothing was found, 1: something was.
int run_scenario(const Scenario& scenario, const Options& options) {
  Profile profile;
  if (ProfileError error; !LoadProfile(VEXA_SOURCE_DIR "/models/profiles/LMX-P200.json", profile, error)) {
    std::fprintf(stderr, "torture: %s\n", error.Message().c_str());
    return 2;
  }
  std::mt19937_64 choose(options.seed);
  std::uint64_t faults = 0;
  int findings = 0;
  for (const FaultRow& fault : kFaults) {
    if (!options.function.empty() && options.function != fault.name) continue;
    Row row(scenario, fault, profile, options);
    const bool tried = row.run(choose);
    faults += row.faults();
    findings += row.findings();
    if (!tried) break;
  }
  dprintf(report_fd, "%s: %llu faults, %d findings\n", scenario.name, static_cast<unsigned long long>(faults),
          findings);
  return findings == 0 && faults > 0 ? 0 : 1;
}

int usage() {
  std::fputs(
      "usage: torture --list | --scenario NAME [--camera PROGRAM] [--function NAME] [--call N | --call N+]\n"
      "               [--one-in N] [--seed S] [--limit SECONDS]\n"
      "functions:",
      stderr);
  for (const FaultRow& row : kFaults) std::fprintf(stderr, " %s", row.name);
  std::fputs("\n", stderr);
  return 2;
}

bool read_options(int argc, char** argv, Options& options) {
  for (int i = 1; i < argc; i += 2) {
    if (i + 1 == argc) return false;
    const std::string_view name = argv[i];
    const char* const value = argv[i + 1];
    if (name == "--camera") {
      options.camera = value;
    } else if (name == "--scenario") {
      options.scenario = value;
    } else if (name == "--function") {
      options.function = value;
    } else if (name == "--call") {
      options.call = std::strtoull(value, nullptr, 10);
      options.and_later = std::strchr(value, '+') != nullptr;
    } else if (name == "--one-in") {
      options.one_in = std::max(1ULL, std::strtoull(value, nullptr, 10));
    } else if (name == "--seed") {
      options.seed = std::strtoull(value, nullptr, 10);
    } else if (name == "--limit") {
      options.limit = static_cast<unsigned>(std::strtoul(value, nullptr, 10));
    } else {
      return false;
    }
  }
  return true;
}

// Of one call that is tried alone, the library's own output is shown.
void quieten(const Options& options) {
  report_fd = dup(STDOUT_FILENO);
  const int nowhere = open("/dev/null", O_WRONLY | O_CLOEXEC);
  if (options.call == 0) {
    dup2(nowhere, STDOUT_FILENO);
    dup2(nowhere, STDERR_FILENO);
  }
  close(nowhere);
}

}  // namespace
}  // namespace vexa::torture

int main(int argc, char** argv) {
  using namespace vexa::torture;
  if (argc == 2 && std::string_view(argv[1]) == "--list") {
    for (const Scenario& scenario : usual_scenarios()) std::puts(scenario.name);
    return 0;
  }
  Options options;
  if (!read_options(argc, argv, options)) return usage();

  for (const int number : {SIGABRT, SIGSEGV, SIGBUS, SIGFPE, SIGILL, SIGPIPE, SIGALRM}) signal(number, ended_by);
  if (const Scenario* const planted = find(planted_scenarios(), options.scenario)) {
    quieten(options);
    return run_scenario(*planted, options);
  }
  const Scenario* const scenario = find(usual_scenarios(), options.scenario);
  if (scenario == nullptr || options.camera == nullptr) return usage();
  const CameraProcess camera(options.camera, options.scenario == "playback");
  if (!camera.ready()) {
    std::fprintf(stderr, "torture: %s did not start as it should\n", options.camera);
    return 2;
  }
  quieten(options);
  return run_scenario(*scenario, options);
}
