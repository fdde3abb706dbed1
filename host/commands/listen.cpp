// SPDX-License-Identifier: Apache-2.0
// vexactl listen: a camera's sound into a file.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <algorithm>
#include <array>
#include <chrono>
#include <cmath>
#include <cstdint>
#include <iterator>
#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "host/base/printable.h"
#include "host/camera/camera_options.h"
#include "host/camera/one_session.h"
#include "host/commands/command.h"
#include "host/console/interrupt.h"
#include "host/console/progress.h"
#include "host/console/terminal.h"
#include "host/recording/sound_file.h"
#include "vexa/models.h"

namespace vexa::host {
namespace {

using Clock = std::chrono::steady_clock;

constexpr double kLongestListening = 366.0 * 24 * 3600;
constexpr char kCompanded[] = "G711";
constexpr std::int32_t kG711 = 10;  // as SLibDAudioFrameInfo::codecType

struct SoundCodec {
  const char* word;
  const char* codec;
  std::int32_t bit_rate;
};

constexpr SoundCodec kSoundCodecs[] = {{"g711_64", kCompanded, 64000},
                                       {"g726_40", "G726", 40000},
                                       {"g726_32", "G726", 32000},
                                       {"g726_24", "G726", 24000},
                                       {"g726_16", "G726", 16000}};

const SoundCodec* find_sound_codec(const std::string& word) {
  const auto* found = std::find_if(std::begin(kSoundCodecs), std::end(kSoundCodecs),
                                   [&word](const SoundCodec& codec) { return word == codec.word; });
  return found == std::end(kSoundCodecs) ? nullptr : found;
}

// How much is wanted, in seconds of sound rather than of the clock.
class SoundLimit {
 public:
  SoundLimit(std::optional<double> seconds, int bit_rate) {
    if (seconds) bytes_ = static_cast<std::uint64_t>(std::llround(*seconds * bit_rate / 8));
  }
  [[nodiscard]] bool reached(std::uint64_t have) const { return bytes_ && have >= *bytes_; }
  // Of the next piece, when so much is there already.
  [[nodiscard]] std::size_t share(std::size_t piece, std::uint64_t have) const {
    return bytes_ ? static_cast<std::size_t>(std::min<std::uint64_t>(piece, *bytes_ - have)) : piece;
  }

 private:
  std::optional<std::uint64_t> bytes_;
};

// How receiving ended: with a problem, with Ctrl-C, or at the limit.
struct Listening {
  ExitCode code = ExitCode::kOk;
  std::optional<Problem> problem;
};

class ListenCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command = program.add_subcommand("listen", "Record a camera's sound into a file");
    add_camera_options(*command, camera_, environment);
    command
        ->add_option("--out", out_,
                     "file to write: .wav for G.711 sound, otherwise the sound as received; - is standard output")
        ->required()
        ->type_name("FILE");
    command->add_option("--codec", codec_, "switch the camera's sound on in this: g711_64, g726_40, _32, _24 or _16")
        ->type_name("WORD");
    command->add_option("--seconds", seconds_, "end after this many seconds of sound")->type_name("N");
    command->add_flag("--forever", forever_, "go on through outages, and wait for a camera that is not there");
    command->footer("Without --seconds it ends with Ctrl-C.");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    if (seconds_ && !(*seconds_ > 0 && *seconds_ <= kLongestListening)) {
      return terminal.report(usage("--seconds is not a number above 0", "For instance: --seconds 10."));
    }
    if (codec_ && find_sound_codec(*codec_) == nullptr) {
      return terminal.report(
          usage("--codec must be g711_64, g726_40, g726_32, g726_24 or g726_16", "For instance: --codec g711_64."));
    }
    FrameFile file = to_standard_output() ? FrameFile("standard output", terminal.results()) : FrameFile(out_);
    if (const auto problem = file.check()) return terminal.report(*problem);
    if (forever_ && !codec_) return listen_by_session(file, terminal);
    Result<OpenCamera> opened = open_camera(camera_, terminal);
    if (!opened) return terminal.report(opened.error());
    if (!forever_) return listen(*opened, file, terminal);
    const ELibDReturnCode result = switch_on(*opened, *find_sound_codec(*codec_));
    if (result != LIBD_OK) return terminal.report(of_a_silent_model(*opened).value_or(opened->driver->explain(result)));
    return listen_by_session(file, terminal);
  }

 private:
  [[nodiscard]] bool to_standard_output() const { return out_ == "-"; }

  ExitCode listen(OpenCamera& camera, FrameFile& file, Terminal& terminal) {
    terminal.progress("connecting");
    SLibDAudioInfo sound;
    ELibDReturnCode result = codec_ ? switch_on(camera, *find_sound_codec(*codec_)) : LIBD_OK;
    if (result == LIBD_OK) result = camera.driver->GetAudioInfo(sound);
    if (result != LIBD_OK || sound.bitRate == 0) {
      const Problem problem = result != LIBD_OK ? camera.driver->explain(result) : no_sound();
      return terminal.report(of_a_silent_model(camera).value_or(problem));
    }
    const SoundFormat format = sound_format_of(out_);
    if (format == SoundFormat::kWave && sound.codec != kCompanded) return terminal.report(no_wave(sound));
    Interrupt::finish_orderly();
    result = camera.driver->StartAudioStreaming();
    if (result != LIBD_OK) return terminal.report(camera.driver->explain(result));
    SoundFile target(file, format);
    Listening received = receive(camera, target, SoundLimit(seconds_, sound.bitRate), terminal);
    camera.driver->StopAudioStreaming();
    if (const auto at_close = target.close(); at_close && !received.problem) received.problem = at_close;
    const ExitCode written = summarise(to_string(camera.address), sound, target.bytes(), terminal);
    if (received.problem) return terminal.report(*received.problem);
    if (received.code == ExitCode::kInterrupted) {
      terminal.say("vexactl: interrupted; what was recorded is complete up to here");
    }
    return received.code == ExitCode::kOk ? written : received.code;
  }

  // Through outages. A camera that changes its codec meanwhile ends it: one file holds one kind of sound.
  ExitCode listen_by_session(FrameFile& file, Terminal& terminal) {
    const Result<SessionOptions> session = session_of(camera_, std::nullopt, 1, kAudioStream);
    if (!session) return terminal.report(session.error());
    SoundFile target(file, sound_format_of(out_));
    const SoundCodec* sound = codec_ ? find_sound_codec(*codec_) : nullptr;
    std::int32_t codec = 0;
    std::optional<Problem> problem;
    std::optional<SoundLimit> limit;
    if (sound != nullptr) limit.emplace(seconds_, sound->bit_rate);
    SessionWork work;
    work.callbacks.audio = [&](Session&, const unsigned char* data, std::size_t length, std::int32_t type) {
      if (problem || (limit && limit->reached(target.bytes()))) return;
      if (codec == 0) {
        codec = type;
        problem = check_kind(type);
        if (!limit) limit.emplace(seconds_, kSoundCodecs[0].bit_rate);
      } else if (codec != type) {
        problem = Problem{ExitCode::kNoVideo, "the camera has changed the codec of its sound", "Begin another file."};
      }
      if (!problem) problem = target.write(data, limit->share(length, target.bytes()));
    };
    work.is_done = [&] { return problem || (limit && limit->reached(target.bytes())); };
    const std::optional<Problem> ended = work_by_session(*session, work, terminal);
    if (const auto at_close = target.close(); at_close && !problem) problem = at_close;
    const SLibDAudioInfo info = info_of(codec, sound);
    const ExitCode written =
        target.bytes() > 0 ? summarise(session->name, info, target.bytes(), terminal) : ExitCode::kOk;
    if (problem) return terminal.report(*problem);
    if (!ended) return written;
    if (ended->code != ExitCode::kInterrupted) return terminal.report(*ended);
    terminal.say("vexactl: interrupted; what was recorded is complete up to here");
    return ended->code;
  }

  // Of a camera's sound whose rate nobody has set here: G.711 has one alone.
  [[nodiscard]] std::optional<Problem> check_kind(std::int32_t type) const {
    if (type == kG711) return std::nullopt;
    if (sound_format_of(out_) == SoundFormat::kWave) return no_wave(info_of(type, nullptr));
    if (codec_ || !seconds_) return std::nullopt;
    return usage("the seconds of this sound cannot be counted", "Give --codec too, or leave out --seconds.");
  }

  static SLibDAudioInfo info_of(std::int32_t type, const SoundCodec* sound) {
    SLibDAudioInfo info;
    info.codec = type == kG711 ? kCompanded : "G726";
    info.bitRate = sound != nullptr ? sound->bit_rate : (type == kG711 ? kSoundCodecs[0].bit_rate : 0);
    info.bitRateLabel = info.bitRate == 0 ? "an unknown rate" : fmt::format("{} Kbps", info.bitRate / 1000);
    return info;
  }

  static ELibDReturnCode switch_on(OpenCamera& camera, const SoundCodec& codec) {
    SLibDAudioInfo wanted;
    wanted.codec = codec.codec;
    wanted.bitRate = codec.bit_rate;
    return camera.driver->SetAudioInfo(wanted);
  }

  static Problem no_sound() {
    return {ExitCode::kNoVideo, "the camera's sound is off", "Switch it on, for instance with --codec g711_64."};
  }

  // Where the camera's model has no audio at all, as far as its profile is installed.
  static std::optional<Problem> of_a_silent_model(OpenCamera& camera) {
    SLibDSystemInfo system;
    if (camera.driver->GetCurrentSystemInfo(system) != LIBD_OK) return std::nullopt;
    const std::vector<std::string> installed = ProfileNames();
    if (std::find(installed.begin(), installed.end(), system.modelName) == installed.end()) return std::nullopt;
    Profile profile;
    ProfileError error;
    if (!LoadProfile(system.modelName, profile, error) || profile.audio.available != 0) return std::nullopt;
    return usage(fmt::format("cameras of model {} have no audio", printable(system.modelName)),
                 fmt::format("vexactl profile show {} lists what the model has.", system.modelName));
  }

  static Problem no_wave(const SLibDAudioInfo& sound) {
    return usage(fmt::format("the camera's sound is {}, which vexactl does not write to .wav", printable(sound.codec)),
                 "Give --out another extension for the sound as received, or switch to --codec g711_64.");
  }

  // Polls the driver until the limit, Ctrl-C or a failure.
  Listening receive(OpenCamera& camera, SoundFile& target, const SoundLimit& limit, Terminal& terminal) {
    const auto silence = std::chrono::milliseconds(camera_.timeout_ms);
    auto last = Clock::now();
    Progress progress(terminal);
    std::array<unsigned char, 4096> piece{};
    while (!limit.reached(target.bytes())) {
      if (Interrupt::requested()) return {ExitCode::kInterrupted, std::nullopt};
      SLibDAudioFrameInfo frame;
      frame.data = piece.data();
      frame.capacity = static_cast<std::int32_t>(piece.size());
      const ELibDReturnCode result = camera.driver->GetCurrentAudioFrame(frame);
      if (result == LIBD_NO_FRAME && Clock::now() - last <= silence) {
        Interrupt::wait(kPollPause);  // on a connection that the camera has closed the call returns at once
        continue;
      }
      if (result == LIBD_NO_FRAME || result == LIBD_TIMEOUT) return ended_by(silent());
      if (result != LIBD_OK) return ended_by(broken_off(camera, result));
      last = Clock::now();
      const std::size_t share = limit.share(static_cast<std::size_t>(frame.length), target.bytes());
      if (const auto problem = target.write(piece.data(), share)) return ended_by(*problem);
      progress.show([&target] { return fmt::format("{} bytes of sound", target.bytes()); });
    }
    return {};
  }

  static Listening ended_by(const Problem& problem) { return {problem.code, problem}; }

  static Problem silent() {
    return {ExitCode::kNoVideo, "the camera has stopped sending sound",
            "Check its network and that its audio input is on."};
  }

  static Problem broken_off(const OpenCamera& camera, ELibDReturnCode result) {
    const Problem reason = camera.driver->explain(result);
    return {ExitCode::kNoVideo, fmt::format("the sound has broken off: {}", reason.text), reason.advice};
  }

  ExitCode summarise(const std::string& camera, const SLibDAudioInfo& sound, std::uint64_t bytes, Terminal& terminal) {
    const double seconds = sound.bitRate > 0 ? static_cast<double>(bytes) * 8 / sound.bitRate : 0;
    std::string text = fmt::format("{}: {:.2f} s of {} at {}, {} bytes\n", out_, seconds, printable(sound.codec),
                                   printable(sound.bitRateLabel), bytes);
    if (camera_.json) {
      text = to_text({{"camera", camera},
                      {"file", out_},
                      {"codec", sound.codec},
                      {"bitsPerSecond", sound.bitRate},
                      {"seconds", seconds},
                      {"bytes", bytes}});
    }
    if (!to_standard_output()) return write_result(terminal, text);
    text.pop_back();
    terminal.say(text);
    return ExitCode::kOk;
  }

  CameraOptions camera_;
  std::optional<std::string> codec_;
  std::optional<double> seconds_;
  std::string out_;
  bool forever_ = false;
};

}  // namespace

std::unique_ptr<Command> make_listen_command() { return std::make_unique<ListenCommand>(); }

}  // namespace vexa::host
