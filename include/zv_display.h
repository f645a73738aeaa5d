/**
 * @file zv_display.h
 * The preview picture in detail: layouts, single windows, picture-in-picture and zoom.
 *
 * The functions work on the display state inside an open card, which zv_display_open() hands out and
 * which lives until zv_Close(). Those with a result answer -1 for a refusal, which changes nothing, and for
 * a null display. Zoom and picture-in-picture need the 1-picture layout and exclude each other; while either
 * is on, the layout is frozen.
 */
#ifndef ZV_DISPLAY_H
#define ZV_DISPLAY_H

#include "zv_type.h"

#ifdef __cplusplus
extern "C" {
#endif

/**
 * Reads the display size, frames the screen, turns zoom off and applies a layout. Zoom goes off in
 * the 1-picture layout only.
 *
 * @param handle  the open card
 * @param mode    a ZV_VIDEO_MODE, 0-5
 * @return the display state, the card's own; null for a bad handle or mode
 *
 * Context: control thread; open or capturing. Does not block.
 */
ZV_DISPLAY *zv_display_open(HANDLE handle, u32 mode);

/**
 * Does nothing: the display state goes with the card.
 *
 * @param display  a display state or null
 *
 * Context: any thread; any state. Does not block.
 */
void zv_display_close(ZV_DISPLAY *display);

/**
 * Lays the windows out.
 *
 * @param display     the display state
 * @param mode        a ZV_VIDEO_MODE, 0-5
 * @param resolution  the ZV_RESOLUTION of the inputs; other values count as 704 pixels
 * @return 0; -1 while zoom or picture-in-picture is on, or for a bad mode
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_display_mux_mode(ZV_DISPLAY *display, u32 mode, u32 resolution);

/**
 * Shows one channel on the whole display; the layout is the 1-picture layout then.
 *
 * @param display  the display state
 * @param channel  0-15; with another number the display is empty
 * @return 0; -1 while zoom or picture-in-picture is on
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_display_select_channel(ZV_DISPLAY *display, u32 channel);

/**
 * Replaces the flags of a window.
 *
 * @param display  the display state
 * @param window   0-15
 * @param flags    ZV_WINDOW_ENABLED, ZV_WINDOW_PIP
 * @return the driver's result, 0 on success; -1 for a window above 15
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_display_channel_mode(ZV_DISPLAY *display, u32 window, u32 flags);

/**
 * Tells which channel is shown at a point. With a picture-in-picture on, it is that channel at any
 * point.
 *
 * @param display  the display state
 * @param x        pixels from the left
 * @param y        lines from the top
 * @return a channel, 0-15; -1 where no window is
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_display_pos2channel(ZV_DISPLAY *display, u32 x, u32 y);

/**
 * Shows or hides the motion marks on the preview.
 *
 * @param display  the display state
 * @param on       non-zero: show; 0: hide
 * @return the driver's result, 0 on success; -1 for a null display
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_display_motion_trace(ZV_DISPLAY *display, u32 on);

/**
 * Magnifies a region of the picture.
 *
 * @param display  the display state
 * @param level    0 is off; what the others magnify, and which of them it refuses, is the card's affair
 * @param x        left edge of the region, pixels; kept between 0 and half the display
 * @param y        top edge of the region, lines; kept between 0 and half the display
 * @return the driver's result, 0 on success; -1 outside the 1-picture layout or with a
 *         picture-in-picture on
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_display_zoom(ZV_DISPLAY *display, u32 level, int x, int y);

/**
 * Shows a channel in a small window, a third of the display wide and high, or takes it away. A
 * second channel leaves the first on screen until the next layout.
 *
 * @param display  the display state
 * @param channel  0-15, one that is not shown; -1 takes the picture-in-picture away
 * @param x        left edge, pixels; kept on the display and rounded down to a multiple of 8
 * @param y        top edge, lines; the same
 * @return 0; -1 outside the 1-picture layout, with zoom on, for a channel already shown or unknown,
 *         or with nothing to take away
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_display_pip(ZV_DISPLAY *display, int channel, u32 x, u32 y);

/**
 * Moves the picture-in-picture; it stays on the display, at multiples of 8.
 *
 * @param display  the display state
 * @param dx       pixels to the right, any int
 * @param dy       lines down, any int
 * @return the driver's result, 0 on success; -1 when there is no picture-in-picture
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_display_pip_move(ZV_DISPLAY *display, int dx, int dy);

#ifdef __cplusplus
}
#endif

#endif
