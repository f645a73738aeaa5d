/**
 * @file internal.h
 * Functions that the SDK's source files call of each other, on a ZV_CARD instead of a HANDLE. A function
 * named like a public function does the same and returns the same statuses.
 */
#ifndef ZV_INTERNAL_H
#define ZV_INTERNAL_H

#include "zv_card.h"

namespace zarvo {

/// Size of the input picture: 720 or 704 pixels, 480 or 576 lines.
struct PictureSize {
  u32 width;
  u32 height;
};
PictureSize input_picture(const ZV_CARD &card);
/// The width of a ZV_RESOLUTION in pixels; every value but RESOLUTION_ZV_720 is 704 pixels.
constexpr u32 input_width(u32 resolution) {
  return resolution == RESOLUTION_ZV_720 ? 720 : 704;
}
/// Returns whether a rectangle lies inside the input picture and is not reversed. Edges may be equal to the
/// limits.
bool fits_input(const ZV_CARD &card, const ZV_RECT &rect);

int set_video_standard(ZV_CARD &card, u32 standard);
int set_preview_mode(ZV_CARD &card, u32 mode);
ZV_DISPLAY *open_display(ZV_CARD &card, u32 mode);

int check_encode_config(ZV_CARD &card);
int enable_record_channels(ZV_CARD &card, u32 mask);
int enable_audio_channels(ZV_CARD &card, u32 mask);
int set_video_config(ZV_CARD &card, u32 channel);

/// The pause of a capture thread between two passes, in microseconds.
inline constexpr u32 kPassPause = 100;
/// Clears the run flags of the capture threads and joins the threads. Returns false when a join fails, for
/// example because the caller is one of these threads.
bool join_capture();
void *get_audio_data_thread(void *card);

/// Switches motion detection off for all channels in the codec chip.
void disable_motion(const ZV_CARD &card);
void write_motion_control(const ZV_CARD &card);
int stop_motion_detection(ZV_CARD &card);
inline constexpr u32 kAllChannels = 0xFFFF;  ///< one bit for each channel
u32 video_loss(ZV_CARD &card);
/// Clears the run flag of the watchdog thread and joins the thread. Returns false when the join fails.
bool join_watchdog();

/// Converts user units to register values 0-255. Rounds the caller's hue toward zero to an even number.
void translate_video_property(ZV_VIDEO_PROPERTY &reg, ZV_VIDEO_PROPERTY &user);
/// Converts register values 0-255 to user units.
void inverse_translate_video_property(ZV_VIDEO_PROPERTY &user, const ZV_VIDEO_PROPERTY &reg);

}  // namespace zarvo

#endif
