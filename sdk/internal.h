/**
 * @file internal.h
 * What the areas of the SDK call of each other, below the door. Each does what the public function
 * of its name does; statuses are the same.
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
/// Pixels of a ZV_RESOLUTION; whatever is not 720 is 704.
constexpr u32 input_width(u32 resolution) {
  return resolution == RESOLUTION_ZV_720 ? 720 : 704;
}
/// Whether a rectangle lies inside the input picture and is not reversed. Edges may touch the limits.
bool fits_input(const ZV_CARD &card, const ZV_RECT &rect);

int set_video_standard(ZV_CARD &card, u32 standard);
int set_preview_mode(ZV_CARD &card, u32 mode);
ZV_DISPLAY *open_display(ZV_CARD &card, u32 mode);

int check_encode_config(ZV_CARD &card);
int enable_record_channels(ZV_CARD &card, u32 mask);
int enable_audio_channels(ZV_CARD &card, u32 mask);
int set_video_config(ZV_CARD &card, u32 channel);

/// Pause of a capture thread between two passes, microseconds.
inline constexpr u32 kPassPause = 100;
/// Clears the run flags of the capture threads and joins them. False on one of these threads itself.
bool join_capture();
void *get_audio_data_thread(void *card);

/// Switches detection off on all channels in the codec chip.
void disable_motion(const ZV_CARD &card);
void write_motion_control(const ZV_CARD &card);
int stop_motion_detection(ZV_CARD &card);
inline constexpr u32 kAllChannels = 0xFFFF;  ///< a bit for every channel
u32 video_loss(ZV_CARD &card);
/// Clears the run flag of the watchdog thread, if it is still set, and joins the thread.
bool join_watchdog();

/// User units to register values 0-255. Makes the caller's hue even, toward zero.
void translate_video_property(ZV_VIDEO_PROPERTY &reg, ZV_VIDEO_PROPERTY &user);
/// Register values 0-255 to user units.
void inverse_translate_video_property(ZV_VIDEO_PROPERTY &user, const ZV_VIDEO_PROPERTY &reg);

}  // namespace zarvo

#endif
