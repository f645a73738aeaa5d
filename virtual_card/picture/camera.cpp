// Draws the picture of a camera.
#include "camera.h"

#include <cmath>
#include <numbers>

#include "frame_mark.h"

namespace virtual_card {

namespace {

constexpr u32 kClockHeight = 40;
constexpr u32 kClockX = 48;
constexpr u32 kClockFromBottom = 88;  ///< lines from the top of the clock to the bottom of the picture
constexpr u32 kBarLines = 64;
constexpr u32 kPatternSize = 64;
constexpr u32 kBallSize = 72;
constexpr u32 kNumberX = 64;
constexpr u32 kNumberY = 104;
constexpr u32 kShadow = 6;

constexpr Colour kClockBox{40, 128, 128};
constexpr u8 kMarkBlack = 24;
constexpr u8 kMarkWhite = 216;

/// 75 % colour bars: white, yellow, cyan, green, magenta, red, blue, black.
constexpr std::array<Colour, 8> kBars{{{180, 128, 128},
                                       {162, 44, 142},
                                       {131, 156, 44},
                                       {112, 72, 58},
                                       {84, 184, 198},
                                       {65, 100, 212},
                                       {35, 212, 114},
                                       {16, 128, 128}}};

/// Returns the hue of a channel. Neighbouring channels differ by 7 of 16 steps of the colour circle.
double base_hue(unsigned channel) {
  return (channel * 7 % kChannels) * 360.0 / kChannels;
}

bool pattern(unsigned channel, u32 x, u32 y) {
  switch ((channel + channel / 4) % 4) {
    case 0:
      return x / kPatternSize % 2 != 0;
    case 1:
      return y / kPatternSize % 2 != 0;
    case 2:
      return (x / kPatternSize + y / kPatternSize) % 2 != 0;
    default:
      return (x + y) / kPatternSize % 2 != 0;
  }
}

/// Shared by all cameras; created at the first use and never freed, since the card may draw until the process
/// ends.
const Font &clock_font() {
  static const Font *const font = new Font(kClockHeight);
  return *font;
}
const Coverage &ball() {
  static const Coverage *const coverage = new Coverage(disc(kBallSize));
  return *coverage;
}

Area clock_area(u32 lines) {
  const u32 y = lines - kClockFromBottom;
  return {kClockX, y, kClockX + clock_font().text_width("00:00:00.00"), y + kClockHeight};
}

/// Returns the place of the ball: a slow curve over the whole picture below the bars, at a speed that differs
/// from camera to camera.
Area ball_area(unsigned channel, double seconds, u32 width, u32 lines) {
  const double turn = 2.0 * std::numbers::pi * (seconds / (3.5 + 0.1 * channel) + channel / 16.0);
  const double across = (1.0 + std::sin(turn)) / 2.0 * (width - 48 - kBallSize);
  const double down = (1.0 + std::sin(turn * 1.5)) / 2.0 * (lines - kBarLines - 112 - kBallSize);
  const u32 x = (24 + static_cast<u32>(across)) & ~1u;
  const u32 y = kBarLines + 8 + static_cast<u32>(down);
  return {x, y, x + kBallSize, y + kBallSize};
}

}  // namespace

bool Camera::adjust(const CardState &state) {
  const ChannelState &channel = state.channel[channel_];
  const driver::Mask &mask = channel.mask;
  const Area mask_area =
      clip({mask.x_start, mask.y_start, mask.x_end, mask.y_end}, state.width, state.lines());
  const Look look{state.width, state.lines(), channel.picture, mask_area, channel.scene, channel.lost};
  if (backdrop_drawn_ && look == look_) return false;
  look_ = look;
  controls_ = PictureControls(look.picture);
  draw_backdrop();
  return true;
}

void Camera::show_film(std::shared_ptr<Film> film) {
  film_ = std::move(film);
  if (look_.width != 0) draw_backdrop();
}

void Camera::draw_backdrop() {
  backdrop_drawn_ = false;
  backdrop_.resize(look_.width, look_.lines);
  if (look_.lost) {
    fill(backdrop_, {0, 0, look_.width, look_.lines}, kLostBlue);
  } else {
    if (look_.scene != Scene::black && !film_) draw_scene();
    controls_.apply(backdrop_);
  }
  fill(backdrop_, look_.mask, kMaskGrey);
  picture_ = backdrop_;
  drawn_ = {kNever, kNever};
  ball_area_ = {};
  film_frame_ = -1;
  backdrop_drawn_ = true;
}

void Camera::draw_scene() {
  const u32 width = look_.width, lines = look_.lines;
  const double hue = base_hue(channel_);
  const Colour shades[] = {colour_from_hsv(hue, 0.65, 0.40), colour_from_hsv(hue, 0.60, 0.52)};
  ball_colour_ = controls_.apply(colour_from_hsv(hue + 180.0, 0.75, 0.95));
  for (u32 y = kBarLines; y < lines; ++y) {
    u8 *const luma = backdrop_.y_line(y), *const cb = backdrop_.cb_line(y), *const cr = backdrop_.cr_line(y);
    for (u32 x = 0; x < width; x += 2) {
      const Colour &shade = shades[pattern(channel_, x, y) ? 1 : 0];
      luma[x] = luma[x + 1] = shade.y;
      cb[x / 2] = shade.cb;
      cr[x / 2] = shade.cr;
    }
  }
  for (u32 bar = 0; bar < kBars.size(); ++bar) {
    fill(backdrop_, {width * bar / 8, 0, width * (bar + 1) / 8, kBarLines}, kBars[bar]);
  }

  const Font number(lines * 2 / 5);
  draw_text(backdrop_, number, channel_text(channel_), kNumberX + kShadow, kNumberY + kShadow, kBlack);
  draw_text(backdrop_, number, channel_text(channel_), kNumberX, kNumberY, kWhite);

  const Area mark = frame_mark_area(width, lines);
  fill(backdrop_, mark, kClockBox);
  if (look_.scene == Scene::still) {
    draw_frame_mark(backdrop_, {channel_, 0, false}, kMarkBlack, kMarkWhite, kAllLines);
  } else {
    const Area clock = clock_area(lines);
    fill(backdrop_, {clock.x_start - 8, clock.y_start - 6, clock.x_end + 8, clock.y_end + 6}, kClockBox);
  }
}

void Camera::draw(const Field &field) {
  std::int64_t &drawn = drawn_[field.parity()];
  if (drawn == field.number) return;
  if (film_ && !look_.lost) {
    draw_film(field);
  } else if (look_.scene == Scene::moving && !look_.lost) {
    draw_moving(field);
  }
  drawn = field.number;
}

void Camera::draw_moving(const Field &field) {
  const u32 width = look_.width, lines = look_.lines;
  const u32 parity = field.parity();
  const Lines lines_of_field = field_lines(parity);
  const Area clock = clock_area(lines);

  copy_area(picture_, backdrop_, ball_area_[parity], lines_of_field);
  copy_area(picture_, backdrop_, clock, lines_of_field);
  ball_area_[parity] = ball_area(channel_, field.seconds(), width, lines);
  blend(picture_, ball(), ball_area_[parity].x_start, ball_area_[parity].y_start, ball_colour_,
        lines_of_field);
  draw_text(picture_, clock_font(), ClockText(field).view(), clock.x_start, clock.y_start,
            controls_.apply(kWhite), lines_of_field);
  const FrameMark mark{channel_, static_cast<std::uint32_t>(field.number / 2), parity != 0};
  draw_frame_mark(picture_, mark, controls_.apply({kMarkBlack, 128, 128}).y,
                  controls_.apply({kMarkWhite, 128, 128}).y, lines_of_field);
  fill(picture_, look_.mask, kMaskGrey, lines_of_field);
}

void Camera::draw_film(const Field &field) {
  const std::int64_t frame = film_->seek(field.seconds());
  if (frame == film_frame_) return;
  film_frame_ = frame;
  film_->copy_to(picture_);
  controls_.apply(picture_);
  fill(picture_, look_.mask, kMaskGrey);
}

}  // namespace virtual_card
