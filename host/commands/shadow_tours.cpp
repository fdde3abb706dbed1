// SPDX-License-Identifier: Apache-2.0
// vexactl shadow: movements by hand that a camera records and plays back.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <nlohmann/json.hpp>

#include "host/base/number_text.h"
#include "host/base/printable.h"
#include "host/commands/action_group.h"
#include "host/console/terminal.h"
#include "host/words/setting_words.h"
#include "host/words/tour_words.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

constexpr char kShadowTours[] = "shadow tours";

std::optional<Problem> check_shadow_tours(const ModelCamera& camera) {
  if (camera.profile().control.shadowTourCount > 0) return std::nullopt;
  return model_lacks(camera, kShadowTours);
}

class ShowShadowsAction final : public CameraAction {
 public:
  CLI::App* declare(CLI::App& group) override { return group.add_subcommand("show", "Show the camera's shadow tours"); }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    SLibDShadowTourInfo info;
    const ELibDReturnCode result = camera.device().GetShadowTourInfo(info);
    if (result != LIBD_OK) return terminal.report(camera.explain(result));
    return write_result(terminal, json() ? to_text(json_of(info)) : table_of(info));
  }

 private:
  static std::string table_of(const SLibDShadowTourInfo& info) {
    std::string text = fmt::format("Shadow tours are {}; {}; the longest recording is {} s\n",
                                   switch_word(info.enabled), resume_text(info.resumeTime), info.maxRecordTime);
    for (const auto& [number, tour] : info.tours) {
      text += fmt::format("{}  {:<3}  {:>4} s recorded\n", number, switch_word(tour.enabled), tour.recordedTime);
    }
    return text;
  }

  static Json json_of(const SLibDShadowTourInfo& info) {
    Json tours = Json::array();
    for (const auto& [number, tour] : info.tours) {
      tours.push_back({{"tour", number}, {"enabled", tour.enabled}, {"recordedSeconds", tour.recordedTime}});
    }
    return {{"enabled", info.enabled},
            {"resumeSeconds", info.resumeTime > 0 ? Json(info.resumeTime) : Json(nullptr)},
            {"longestRecordingSeconds", info.maxRecordTime},
            {"tours", tours}};
  }
};

class ResumeShadowsAction final : public CameraAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand("resume", "Set when a shadow tour resumes after a move by hand");
    action->add_option("seconds", seconds_, "until it resumes; 0: never")
        ->required()
        ->type_name("")
        ->check(CLI::Range(0, kLongestResume));
    return action;
  }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    SLibDShadowTourInfo info;
    const ELibDReturnCode read = camera.device().GetShadowTourInfo(info);
    if (read != LIBD_OK) return terminal.report(camera.explain(read));
    info.resumeTime = seconds_;
    return report_change(camera, terminal, kShadowTours, camera.device().SetShadowTourInfo(info));
  }

 private:
  int seconds_ = 0;
};

using StartShadow = ELibDReturnCode (CLibraryDevice::*)(int);
using StopShadow = ELibDReturnCode (CLibraryDevice::*)();

// An action that is begun with a number and ended without.
struct ShadowWords {
  const char* name;
  const char* description;
  StartShadow start;
  StopShadow stop;  // null: the action takes no "stop"
};

class ShadowAction final : public CameraAction {
 public:
  explicit ShadowAction(ShadowWords words) : words_(words) {}

  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand(words_.name, words_.description);
    action
        ->add_option("number", word_,
                     words_.stop != nullptr ? "of the shadow tour, counted from 1, or stop"
                                            : "of the shadow tour, counted from 1")
        ->required()
        ->type_name("");
    return action;
  }

  std::optional<Problem> check() override {
    if (stops()) return std::nullopt;
    number_ = number_text(word_).value_or(0);
    if (number_ >= 1) return std::nullopt;
    return usage("shadow tours are counted from 1", "vexactl shadow CAMERA show shows them.");
  }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    CLibraryDevice& device = camera.device();
    if (stops()) return report_change(camera, terminal, kShadowTours, (device.*words_.stop)());
    const int count = camera.profile().control.shadowTourCount;
    if (number_ > count) {
      return terminal.report(usage(fmt::format("the camera has no shadow tour {}", number_),
                                   fmt::format("It has shadow tours 1 to {}.", count)));
    }
    return report_change(camera, terminal, kShadowTours, (device.*words_.start)(number_));
  }

 private:
  [[nodiscard]] bool stops() const { return words_.stop != nullptr && word_ == "stop"; }

  ShadowWords words_;
  std::string word_;
  int number_ = 0;
};

class StopShadowAction final : public CameraAction {
 public:
  CLI::App* declare(CLI::App& group) override { return group.add_subcommand("stop", "End the running shadow tour"); }
  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    return report_change(camera, terminal, kShadowTours, camera.device().StopShadowTour());
  }
};

}  // namespace

std::unique_ptr<Command> make_shadow_command() {
  constexpr ShadowWords kRecord{"record", "Record what moves the camera from now on, or stop recording",
                                &CLibraryDevice::StartRecordShadowTour, &CLibraryDevice::StopRecordShadowTour};
  constexpr ShadowWords kPreview{"preview", "Play a recording once, or stop that",
                                 &CLibraryDevice::StartPreviewShadowTour, &CLibraryDevice::StopPreviewShadowTour};
  constexpr ShadowWords kStart{"start", "Play a shadow tour over and over", &CLibraryDevice::StartShadowTour, nullptr};
  std::vector<std::unique_ptr<CameraAction>> actions;
  actions.push_back(std::make_unique<ShowShadowsAction>());
  actions.push_back(std::make_unique<ShadowAction>(kRecord));
  actions.push_back(std::make_unique<ShadowAction>(kPreview));
  actions.push_back(std::make_unique<ShadowAction>(kStart));
  actions.push_back(std::make_unique<StopShadowAction>());
  actions.push_back(std::make_unique<ResumeShadowsAction>());
  constexpr ActionGroupText kText{"shadow", "Record, preview, start and stop a camera's shadow tours",
                                  "For instance:\n  vexactl shadow 192.168.0.100 record 1\n"
                                  "  vexactl ptz 192.168.0.100 pan left --for 5\n"
                                  "  vexactl shadow 192.168.0.100 record stop\n"
                                  "  vexactl shadow 192.168.0.100 start 1"};
  return std::make_unique<ActionGroup>(kText, check_shadow_tours, std::move(actions));
}

}  // namespace vexa::host
