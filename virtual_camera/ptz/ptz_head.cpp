// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/ptz/ptz_head.h"

#include <fmt/format.h>

#include <cmath>
#include <cstdint>
#include <utility>

#include "virtual_camera/wire/message.h"

namespace vexa::camera {
namespace {

constexpr std::size_t kMostOrders = 2048;  // of one recording; those beyond are obeyed alone
constexpr double kEndOfTime = 1e12;        // seconds; doubles still resolve milliseconds there
constexpr double kBeforePlaying = 1;       // seconds that a shadow tour waits at its start

std::string position_text(const PtzPlace& place, bool turned, bool moving) {
  const auto word = [](int value) { return static_cast<std::uint16_t>(value); };
  const int side = turned ? -1 : 1;
  return fmt::format("CamPos: 111{:04X}{:04X}{:04X}{}", word(side * place[0]), word(side * place[1]), word(place[2]),
                     moving ? 'M' : 'S');
}

}  // namespace

PtzHead::PtzHead(const PtzProfile& profile, Time start, double pace)
    : mechanism_(profile), section_(profile), start_(start), pace_(pace) {}

double PtzHead::catch_up(Time now) {
  latest_ = std::max(latest_, std::min(std::chrono::duration<double>(now - start_).count() * pace_, kEndOfTime));
  if (recording_ && latest_ >= recording_->began + kLongestRecording) {
    const double end = recording_->began + kLongestRecording;
    keep_recording(end);
    resume_later(end);
  }
  while (program_ && program_->due <= latest_) {
    if (program_->kind == PtzProgram::Kind::kCamera) {
      step_camera_tour();
    } else {
      step_shadow_tour();
    }
  }
  return latest_;
}

// The tour that the settings want, from its beginning.
void PtzHead::begin_program(double due) {
  program_.reset();
  if (section_.camera_tour() != nullptr) {
    program_.emplace();
  } else if (const ShadowTour* tour = section_.shadow_tour(); tour != nullptr && tour->length > 0) {
    program_.emplace();
    program_->kind = PtzProgram::Kind::kShadow;
    program_->shadow = *tour;
  }
  if (program_) program_->due = due;
}

// A host has moved the camera: tours go on once it has been at rest for the resume time, or are over.
void PtzHead::resume_later(double now) {
  const int resume = section_.camera_switch.on ? section_.camera_switch.resume : section_.shadow_switch.resume;
  if (resume == 0) section_.end_tours();
  const double due = at_rest(now) + resume;
  if (resume == 0 || !program_ || program_->kind != PtzProgram::Kind::kCamera) return begin_program(due);
  program_->due = due;
  program_->laps = 0;
}

// Laps are all alike once one has been made: those that are over are left out.
void PtzHead::begin_lap() {
  PtzProgram& program = *program_;
  const double length = program.due - program.lap;
  if (program.laps > 1 && latest_ - program.due > length) {
    program.due += std::floor((latest_ - program.due) / length) * length;
  }
  program.lap = program.due;
  ++program.laps;
}

void PtzHead::step_camera_tour() {
  const CameraTour& tour = *section_.camera_tour();
  if (program_->step == 0) begin_lap();
  const auto is_set = [this](int number) { return section_.presets.contains(number); };
  const auto from = tour.sequence.begin() + static_cast<std::ptrdiff_t>(program_->step);
  const auto next = std::find_if(from, tour.sequence.end(), is_set);
  program_->step = 0;
  if (next == tour.sequence.end()) {
    if (std::none_of(tour.sequence.begin(), tour.sequence.end(), is_set)) program_.reset();
    return;
  }
  const Preset& preset = section_.presets.at(*next);
  mechanism_.obey(order_to(preset.place, tour.speed, mechanism_.profile()), program_->due);
  program_->due = at_rest(program_->due) + tour.stay;
  if (next + 1 != tour.sequence.end()) program_->step = static_cast<std::size_t>(next + 1 - tour.sequence.begin());
}

// Step 0 goes to the start; each further one obeys an order; after the last one the camera is at rest.
void PtzHead::step_shadow_tour() {
  PtzProgram& program = *program_;
  const auto& orders = program.shadow.orders;
  if (program.step == 0) {
    begin_lap();
    mechanism_.obey(order_to(program.shadow.start, mechanism_.profile().shared_speed(), mechanism_.profile()),
                    program.due);
    program.origin = at_rest(program.due) + kBeforePlaying;
  } else if (program.step <= orders.size()) {
    mechanism_.obey(orders[program.step - 1].second, program.due);
  } else {
    mechanism_.brake(program.due);
    program.step = 0;
    program.due = at_rest(program.due);
    if (program.kind == PtzProgram::Kind::kPreview) resume_later(program.due);
    return;
  }
  program.due = program.origin + (program.step < orders.size() ? orders[program.step].first : program.shadow.length);
  ++program.step;
}

void PtzHead::obey_by_hand(const PtzOrder& order, double now) {
  mechanism_.obey(order, now);
  if (recording_ && recording_->made.orders.size() < kMostOrders) {
    recording_->made.orders.emplace_back(now - recording_->began, order);
  }
  if (!recording_) resume_later(now);
}

void PtzHead::keep_recording(double now) {
  if (!recording_) return;
  ShadowTour& tour = *section_.shadow_tour_of(recording_->letter);
  recording_->made.on = tour.on;
  recording_->made.length = now - recording_->began;
  tour = std::move(recording_->made);
  recording_.reset();
}

bool PtzHead::move(const Pairs& commands, const PtzPicture& picture, Time now) {
  const std::lock_guard<std::mutex> lock(mutex_);
  std::vector<PtzOrder> orders;
  for (const auto& [key, value] : commands) {
    const std::optional<PtzOrder> order = ptz_order(key, value, mechanism_.profile(), picture);
    if (!order) return false;
    orders.push_back(*order);
  }
  const double time = catch_up(now);
  for (const PtzOrder& order : orders) obey_by_hand(order, time);
  return !orders.empty();
}

bool PtzHead::command_presets(const Pairs& commands, Time now) {
  constexpr struct {
    std::string_view key;
    bool (PtzHead::*act)(std::string_view, double);
  } kActions[] = {{"PresetSet", &PtzHead::set_preset},
                  {"PresetCall", &PtzHead::call_preset},
                  {"PresetClear", &PtzHead::clear_preset},
                  {"STourRecord", &PtzHead::record},
                  {"STourPreview", &PtzHead::preview}};
  const std::lock_guard<std::mutex> lock(mutex_);
  const double time = catch_up(now);
  for (const auto& action : kActions) {
    if (commands.size() == 1 && commands[0].first == action.key) return (this->*action.act)(commands[0].second, time);
  }
  return set_tours(commands, time);
}

// "NUMBER,NAME,on": with a picture of it or without.
bool PtzHead::set_preset(std::string_view value, double now) {
  const std::vector<std::string_view> words = comma_pieces(value);
  if (words.size() != 3 || (words[2] != "on" && words[2] != "off")) return false;
  const auto number = number_within(words[0], 1, mechanism_.profile().presets);
  const std::optional<std::string> name = percent_decoded(words[1]);
  if (!number || !name || name->empty() || name->size() > kLongestPresetName) return false;
  section_.presets[*number] = {*name, mechanism_.place(now)};
  return true;
}

// "NUMBER,SPEED".
bool PtzHead::call_preset(std::string_view value, double now) {
  const PtzProfile& profile = mechanism_.profile();
  const std::vector<std::string_view> words = comma_pieces(value);
  if (words.size() != 2) return false;
  const auto number = number_within(words[0], 1, profile.presets);
  const auto speed = number_within(words[1], 1, profile.shared_speed());
  const auto preset = number ? section_.presets.find(*number) : section_.presets.end();
  if (!speed || preset == section_.presets.end()) return false;
  obey_by_hand(order_to(preset->second.place, *speed, profile), now);
  return true;
}

bool PtzHead::clear_preset(std::string_view value, double) {
  const auto number = number_within(value, 1, mechanism_.profile().presets);
  if (number) section_.presets.erase(*number);
  return number.has_value();
}

bool PtzHead::record(std::string_view value, double now) {
  if (section_.shadow_tours.empty()) return false;
  if (value == "stop") {
    const bool recorded = recording_.has_value();
    keep_recording(now);
    if (recorded) resume_later(now);
    return true;
  }
  if (section_.shadow_tour_of(value) == nullptr) return false;
  keep_recording(now);
  program_.reset();
  mechanism_.brake(now);
  recording_ = PtzRecording{std::string(value), now, {}};
  recording_->made.start = mechanism_.place(mechanism_.rests_from());
  return true;
}

bool PtzHead::preview(std::string_view value, double now) {
  if (section_.shadow_tours.empty()) return false;
  if (value == "stop") {
    if (!program_ || program_->kind != PtzProgram::Kind::kPreview) return true;
    mechanism_.brake(now);
    resume_later(now);
    return true;
  }
  const ShadowTour* tour = section_.shadow_tour_of(value);
  if (tour == nullptr || tour->length <= 0) return false;
  keep_recording(now);
  program_.emplace();
  program_->kind = PtzProgram::Kind::kPreview;
  program_->shadow = *tour;
  program_->due = now;
  return true;
}

bool PtzHead::set_tours(const Pairs& settings, double now) {
  if (!section_.set_tours(settings)) return false;
  keep_recording(now);
  const bool ran = program_.has_value();
  begin_program(now);
  if (ran && !program_) mechanism_.brake(now);
  return true;
}

PtzHead::Pairs PtzHead::preset_settings(Time now) {
  const std::lock_guard<std::mutex> lock(mutex_);
  (void)catch_up(now);
  return section_.answer();
}

CameraPose PtzHead::pose(bool turned, Time now) {
  const std::lock_guard<std::mutex> lock(mutex_);
  const double time = catch_up(now);
  return {mechanism_.pan_degrees(time), mechanism_.tilt_degrees(time), mechanism_.horizontal_angle(time),
          position_text(mechanism_.place(time), turned, mechanism_.looks_elsewhere(time))};
}

std::vector<PresetMark> PtzHead::preset_marks() {
  const std::lock_guard<std::mutex> lock(mutex_);
  const PtzProfile& profile = mechanism_.profile();
  std::vector<PresetMark> marks;
  for (const auto& [number, preset] : section_.presets) {
    const double pan = preset.place[static_cast<std::size_t>(PtzMotor::kPan)];
    const double tilt = preset.place[static_cast<std::size_t>(PtzMotor::kTilt)];
    marks.push_back(
        {number, pan * profile.pan.degrees_of_unit(), (tilt - profile.tilt.offset) * profile.tilt.degrees_of_unit()});
  }
  return marks;
}

PtzPlace PtzHead::place(Time now) {
  const std::lock_guard<std::mutex> lock(mutex_);
  return mechanism_.place(catch_up(now));
}

}  // namespace vexa::camera
