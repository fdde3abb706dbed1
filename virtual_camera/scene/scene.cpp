// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/scene/scene.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <iterator>
#include <string>

#include "virtual_camera/scene/scene_painter.h"

namespace vexa::camera {
namespace {

using Millidegrees = std::int64_t;

constexpr Millidegrees kDegree = 1000;
constexpr Millidegrees kFullTurn = 360 * kDegree;
constexpr Millidegrees kNadir = -90 * kDegree;
constexpr Millidegrees kZenith = 90 * kDegree;
constexpr Colour kBeyond{30, 128, 128};  // above the zenith and below the nadir
constexpr Colour kDark{18, 128, 128};
constexpr Colour kClock{225, 128, 128};
constexpr Colour kClockGround{16, 128, 128};
constexpr std::uint8_t kTile = 8;  // by which every other tile of 10 degrees is brighter

// What one picture is drawn with. Everything is laid out upright; the painter turns it where the picture is rotated.
struct Canvas {
  Canvas(const View& view, I420Picture& target)
      : picture(target),
        size{target.width(), target.height()},
        place({view.pose, size, false}),
        rotated(view.rotated),
        painter(target, view.rotated),
        dot(std::max(size.height / 270, 1)) {}

  [[nodiscard]] int column(double bearing) const { return pixel(place.column(bearing)); }
  [[nodiscard]] int row(double elevation) const { return pixel(place.row(elevation)); }
  [[nodiscard]] static int pixel(double at) {
    constexpr double kFar = 1e6;  // a magnified figure may end far outside
    return std::isnan(at) ? 0 : static_cast<int>(std::floor(std::clamp(at, -kFar, kFar)));
  }

  I420Picture& picture;
  PictureSize size;
  Projection place;
  bool rotated;
  ScenePainter painter;
  int dot;  // pixels of a letter's dot
};

Colour background_at(double elevation) {
  const int degrees = static_cast<int>(std::floor(elevation));
  if (degrees < -90 || degrees >= 90) return kBeyond;
  if (degrees >= 0) return {static_cast<std::uint8_t>(170 - degrees / 2), 145, 120};
  return {static_cast<std::uint8_t>(100 + degrees / 3), 118, 124};
}

bool odd_tile(double degrees) { return static_cast<int>(std::floor(degrees / 10)) % 2 != 0; }

void draw_background(Canvas& canvas) {
  const auto width = static_cast<std::size_t>(canvas.size.width);
  std::array<std::vector<std::uint8_t>, 2> tiles;  // by column, for even and odd rows of tiles
  for (int column = 0; column < canvas.size.width; ++column) {
    const bool odd = odd_tile(canvas.place.bearing(column + 0.5));
    tiles[0].push_back(odd ? kTile : 0);
    tiles[1].push_back(odd ? 0 : kTile);
  }
  if (canvas.rotated) {
    for (auto& row : tiles) std::reverse(row.begin(), row.end());
  }
  const std::uint8_t* drawn = nullptr;
  Colour drawn_colour;
  bool drawn_odd = false;
  for (int row = 0; row < canvas.size.height; ++row) {
    const double elevation = canvas.place.elevation(row + 0.5);
    const Colour colour = background_at(elevation);
    const bool odd = odd_tile(elevation);
    const int line = canvas.rotated ? canvas.size.height - 1 - row : row;
    std::uint8_t* to = canvas.picture.y() + static_cast<std::size_t>(line) * width;
    if (drawn != nullptr && drawn_colour == colour && drawn_odd == odd) {
      std::memcpy(to, drawn, width);
    } else {
      const std::vector<std::uint8_t>& tile = tiles[odd ? 1 : 0];
      std::transform(tile.begin(), tile.end(), to,
                     [&](std::uint8_t brighter) { return static_cast<std::uint8_t>(colour.y + brighter); });
    }
    drawn = to;
    drawn_colour = colour;
    drawn_odd = odd;
    if (row % 2 != 0) continue;
    const auto half = static_cast<std::size_t>(line / 2) * (width / 2);
    std::memset(canvas.picture.u() + half, colour.u, width / 2);
    std::memset(canvas.picture.v() + half, colour.v, width / 2);
  }
}

// Between two numbers of the scale; a tenth of it is between two ticks.
Millidegrees scale_step(const Canvas& canvas) {
  constexpr Millidegrees kSteps[] = {10, 20, 50, 100, 200, 500, 1000, 2000, 5000, 10000, 15000, 30000, 90000};
  const double least = 72.0 * canvas.dot / canvas.place.pixels_per_degree() * static_cast<double>(kDegree);
  const auto* step = std::lower_bound(std::begin(kSteps), std::end(kSteps) - 1, least,
                                      [](Millidegrees s, double wanted) { return static_cast<double>(s) < wanted; });
  return *step;
}

std::string degrees_text(Millidegrees angle) {
  if (angle % kDegree == 0) return std::to_string(angle / kDegree);
  return fmt::format("{:.2f}", static_cast<double>(angle) / static_cast<double>(kDegree));
}

std::string bearing_text(Millidegrees bearing) {
  constexpr Millidegrees kQuarter = 90 * kDegree;
  if (bearing % kQuarter != 0) return degrees_text(bearing);
  return std::string(1, "NESW"[bearing / kQuarter % 4]);
}

struct ScaleRange {
  Millidegrees first;
  Millidegrees last;
};

// The multiples of `step` from one angle to the other.
ScaleRange range_of(double from, double to, Millidegrees step) {
  const double unit = static_cast<double>(step) / static_cast<double>(kDegree);
  return {static_cast<Millidegrees>(std::ceil(from / unit)) * step,
          static_cast<Millidegrees>(std::floor(to / unit)) * step};
}

double in_degrees(Millidegrees angle) { return static_cast<double>(angle) / static_cast<double>(kDegree); }

// One line of the scale, along an elevation.
void draw_scale_line(Canvas& canvas, Millidegrees elevation, ScaleRange bearings, Millidegrees step) {
  const int line = canvas.row(in_degrees(elevation));
  const int dot = canvas.dot;
  canvas.painter.fill({0, line, canvas.size.width, 1}, kScale);
  for (Millidegrees at = bearings.first; at <= bearings.last; at += step / 10) {
    const int column = canvas.column(in_degrees(at));
    const bool numbered = at % step == 0;
    const int tick = (numbered ? 8 : at % (step / 2) == 0 ? 5 : 3) * dot;
    canvas.painter.fill({column, line - tick, std::max(dot / 2, 1), tick}, kScale);
    if (!numbered) continue;
    const Millidegrees bearing = (at % kFullTurn + kFullTurn) % kFullTurn;
    canvas.painter.write(bearing_text(bearing), column + 2 * dot, line - (2 + kLetterHeight + 3) * dot, dot, kScale);
    canvas.painter.write(degrees_text(elevation), column + 2 * dot, line + 3 * dot, dot, kScale);
  }
}

void draw_scale(Canvas& canvas) {
  const Millidegrees step = scale_step(canvas);
  const double half_width = canvas.size.width / canvas.place.pixels_per_degree() / 2;
  const double pan = canvas.place.bearing(canvas.size.width / 2.0);
  const ScaleRange bearings = range_of(pan - half_width, pan + half_width, step / 10);
  const ScaleRange elevations = range_of(canvas.place.elevation(canvas.size.height), canvas.place.elevation(0), step);
  for (Millidegrees at = std::max(elevations.first, kNadir); at <= std::min(elevations.last, kZenith); at += step) {
    draw_scale_line(canvas, at, bearings, step);
  }
}

void draw_posts(Canvas& canvas) {
  for (int bearing = 0; bearing < 360; bearing += 90) {
    const Area post{canvas.column(bearing) - canvas.dot, 0, 2 * canvas.dot, canvas.size.height};
    canvas.painter.fill(post, bearing == 0 ? kNorthPost : kOtherPost);
  }
}

void draw_mark(Canvas& canvas, const PresetMark& mark) {
  const int dot = canvas.dot;
  const std::string number = std::to_string(mark.number);
  const int column = canvas.column(mark.pan);
  const int row = canvas.row(mark.tilt);
  const int width = (kLetterPitch * static_cast<int>(number.size()) + 3) * dot;
  const int top = row - 26 * dot;
  canvas.painter.fill({column - dot / 2, top, std::max(dot, 2), 26 * dot + 1}, kFlag);
  canvas.painter.fill({column, top, width, (kLetterHeight + 4) * dot}, kFlag);
  canvas.painter.write(number, column + 2 * dot, top + 2 * dot, dot, kDark);
}

void draw_figure(Canvas& canvas, const Intruder& intruder) {
  const double unit = intruder.height / 20;  // degrees
  // A part of the body: from the middle to the right, and from the feet up, in units.
  const auto part = [&](double left, double bottom, double width, double height) {
    const double pixels = canvas.place.pixels_per_degree() * unit;
    const double middle = canvas.place.column(intruder.bearing);
    const double ground = canvas.place.row(intruder.feet);
    const int x = Canvas::pixel(middle + left * pixels);
    const int y = Canvas::pixel(ground - (bottom + height) * pixels);
    canvas.painter.fill({x, y, std::max(Canvas::pixel(middle + (left + width) * pixels) - x, 1),
                         std::max(Canvas::pixel(ground - bottom * pixels) - y, 1)},
                        kFigure);
  };
  const double swing = 3 * std::abs(2 * (intruder.steps - std::floor(intruder.steps)) - 1);
  part(-2, 16, 4, 4);
  part(-2.5, 8, 5, 7.5);
  part(-4, 11, 1.5, 4.5);
  part(2.5, 11, 1.5, 4.5);
  part(-1 - swing, 0, 2, 8);
  part(swing - 1, 0, 2, 8);
}

void draw_clock(I420Picture& picture, int dot, std::chrono::milliseconds clock) {
  const auto now = clock.count();
  const std::string text =
      fmt::format("{:02}:{:02}:{:02}.{:03}", now / 3600000 % 24, now / 60000 % 60, now / 1000 % 60, now % 1000);
  ScenePainter painter(picture, false);
  const int width = (kLetterPitch * static_cast<int>(text.size()) + 3) * dot;
  painter.fill({0, 0, width, (kLetterHeight + 4) * dot}, kClockGround);
  painter.write(text, 2 * dot, 2 * dot, dot, kClock);
}

}  // namespace

std::chrono::milliseconds clock_of(std::chrono::system_clock::time_point now) {
  constexpr std::chrono::milliseconds kDay = std::chrono::hours(24);
  const auto since = std::chrono::duration_cast<std::chrono::milliseconds>(now.time_since_epoch()) % kDay;
  return since.count() < 0 ? since + kDay : since;
}

void render(const View& view, const SceneMoment& moment, I420Picture& picture) {
  picture.resize(view.size.width, view.size.height);
  Canvas canvas(view, picture);
  if (moment.covered) {
    canvas.painter.fill({0, 0, canvas.size.width, canvas.size.height}, kDark);
  } else {
    draw_background(canvas);
    draw_scale(canvas);
    draw_posts(canvas);
    for (const PresetMark& mark : moment.presets) draw_mark(canvas, mark);
    if (moment.intruder) draw_figure(canvas, *moment.intruder);
  }
  draw_clock(picture, canvas.dot, moment.clock);
}

}  // namespace vexa::camera
