/**
 * @file frame_rates.h
 * The frame rates an operator can choose, as their labels; shared by the dialog and the player.
 */
#ifndef FRAME_RATES_H
#define FRAME_RATES_H

/// Frames a second, falling; the place in the list is the interval code. A null ends each list.
extern const char *const ntsc_fps_str[];
extern const char *const pal_fps_str[];

#endif
