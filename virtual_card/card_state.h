/**
 * @file card_state.h
 * The settings that commands, registers and items have set. The devices write them; the engine draws and
 * encodes from a copy.
 */
#ifndef VIRTUAL_CARD_CARD_STATE_H
#define VIRTUAL_CARD_CARD_STATE_H

#include <array>

#include "video_standard.h"
#include "virtual_card.h"
#include "zv_driver.h"

namespace virtual_card {

namespace driver = zarvo::driver;

inline constexpr unsigned kChannels = ZV_CHANNELS;
inline constexpr unsigned kAudioInputs = ZV_AUDIO_CHANNELS;
inline constexpr u32 kMaxWidth = 720;
inline constexpr u32 kNarrowWidth = 704;
inline constexpr u32 kMaxLines = kPal.lines;
/// The motion threshold of every block at power-up.
inline constexpr u16 kDefaultMotionLevel = 12;

/// What is in front of a camera. A film, if there is one, hides it.
enum class Scene {
  moving,  ///< bars, a moving object, a running clock
  still,   ///< bars and the channel number; nothing moves
  black    ///< black, like a covered lens
};

struct EncoderSettings {
  u32 scale_code = 0;     ///< 0 off, 1 half D1, 2 CIF, 9 D1
  u32 interval_code = 0;  ///< bits 0-7 skip, bit 9 drop mode
  u32 gop = 0;
  u32 qp = 0;
  driver::Cbr cbr{};
  driver::QpRange qp_range{};
  bool number_overlay = false;  ///< draw the channel number into the encoded picture
};

/// The picture properties in a channel's decoder registers; 128 is neutral.
struct PictureSettings {
  u8 hue = 128;
  u8 saturation = 128;
  u8 contrast = 128;
  u8 brightness = 128;

  bool operator==(const PictureSettings &) const = default;
};

struct ChannelState {
  EncoderSettings encoder;
  PictureSettings picture;
  driver::Mask mask{};  ///< pixels and lines, multiples of 8; empty: no mask
  Scene scene = Scene::moving;
  bool lost = false;
};

/// The layout settings that are changed together between DISP_IOC_BEGIN_UPDATE and DISP_IOC_END_UPDATE.
struct Layout {
  std::array<ZV_DISPLAY_WINDOW, 16> window{};
  driver::Zoom zoom{};
  std::array<driver::FrameRect, 2> frame{};
  driver::Grid grid{};
};

struct DisplayState {
  Layout layout;
  std::array<u32, 16> routing{};  ///< channel that each window shows; window.channel is not used
  bool on = false;
  bool motion_trace = false;
};

struct CardState {
  u32 standard = VIDEO_STANDARD_ZV_NTSC;
  u32 width = kMaxWidth;
  bool encoding = false;  ///< between ENC_IOC_START and ENC_IOC_STOP
  u32 mjpeg_quality = driver::kMjpegFine;
  u32 motion_enable = 0;  ///< bit n: motion detection on channel n
  u32 sound_present = 0xF;
  std::array<ChannelState, kChannels> channel{};
  DisplayState display;

  u32 lines() const { return video_standard(standard).lines; }
};

}  // namespace virtual_card

#endif
