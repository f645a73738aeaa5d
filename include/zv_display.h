/**
 * @file zv_display.h
 * The preview picture in detail: layouts, single windows, picture-in-picture and zoom.
 *
 * The functions work on the display state of an open card. zv_display_open() returns a pointer to it, which
 * is valid until zv_Close(). Functions that return an int return -1 when they refuse (nothing changes) and
 * for a null display. Zoom and picture-in-picture need the 1-picture layout and exclude each other; while
 * either is on, the layout cannot change.
 */
#ifndef ZV_DISPLAY_H
#define ZV_DISPLAY_H

#include "zv_type.h"

#ifdef __cplusplus
extern "C" {
#endif

/**
 * Reads the display size, draws the frame around the screen and applies a layout. Turns zoom off only when
 * @p mode is the 1-picture layout and no picture-in-picture is on. While a picture-in-picture is on or zoom
 * stays on, only stores @p mode: the windows keep the places they had.
 *
 * @param handle  the open card
 * @param mode    a ZV_VIDEO_MODE, 0-5
 * @return the display state, owned by the card; null for a bad handle or a mode above 5
 *
 * Context: control thread; open or capturing. Does not block.
 */
ZV_DISPLAY *zv_display_open(HANDLE handle, u32 mode);

/**
 * Does nothing: zv_Close() frees the display state.
 *
 * @param display  a display state or null
 *
 * Context: any thread; any state. Does not block.
 */
void zv_display_close(ZV_DISPLAY *display);

/**
 * Applies a layout: gives every window its place.
 *
 * @param display     the display state
 * @param mode        a ZV_VIDEO_MODE, 0-5
 * @param resolution  the ZV_RESOLUTION of the inputs; other values count as 704 pixels
 * @return 0; -1 while zoom or a picture-in-picture is on, or for a mode above 5
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_display_mux_mode(ZV_DISPLAY *display, u32 mode, u32 resolution);

/**
 * Shows one channel on the whole display and makes the 1-picture layout the stored mode.
 *
 * @param display  the display state
 * @param channel  0-15; any other number hides all windows
 * @return 0; -1 while zoom or a picture-in-picture is on
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_display_select_channel(ZV_DISPLAY *display, u32 channel);

/**
 * Replaces all flags of a window.
 *
 * @param display  the display state
 * @param window   0-15
 * @param flags    the new flags: ZV_WINDOW_ENABLED, ZV_WINDOW_PIP, both or 0
 * @return the driver's result, 0 on success; -1 for a window above 15
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_display_channel_mode(ZV_DISPLAY *display, u32 window, u32 flags);

/**
 * Returns the channel shown at a point of the display. While a picture-in-picture is on, its channel is
 * returned for every point.
 *
 * @param display  the display state
 * @param x        pixels from the left
 * @param y        lines from the top
 * @return a channel, 0-15; -1 when no window contains the point
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
 * Magnifies a part of the picture.
 *
 * @param display  the display state
 * @param level    0 turns zoom off; the card decides what other levels do and which it rejects
 * @param x        left edge of the part, pixels; clamped to 0 ... half the display width
 * @param y        top edge of the part, lines; clamped to 0 ... half the display height
 * @return the driver's result, 0 on success; -1 outside the 1-picture layout or while a
 *         picture-in-picture is on
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_display_zoom(ZV_DISPLAY *display, u32 level, int x, int y);

/**
 * Shows a channel in a small window, a third of the display wide and high, or removes that window. If
 * another channel is already shown as picture-in-picture, it stays on screen until a layout is applied.
 *
 * @param display  the display state
 * @param channel  0-15, a channel that is not shown; -1 removes the picture-in-picture
 * @param x        left edge, pixels; clamped so that the window fits, and rounded down to a multiple of 8
 * @param y        top edge, lines; clamped and rounded in the same way
 * @return 0; -1 outside the 1-picture layout, while zoom is on, for a channel that is already shown or
 *         does not exist, or when there is no picture-in-picture to remove
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_display_pip(ZV_DISPLAY *display, int channel, u32 x, u32 y);

/**
 * Moves the picture-in-picture. Its position is clamped and rounded as in zv_display_pip().
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
