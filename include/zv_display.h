#ifndef ZV_DISPLAY_H
#define ZV_DISPLAY_H

#include "zv_type.h"

#ifdef __cplusplus
extern "C" {
#endif

ZV_DISPLAY *zv_display_open(HANDLE, u32 mode);
void zv_display_close(ZV_DISPLAY *);
int zv_display_mux_mode(ZV_DISPLAY *, u32 mode, u32 resolution);
int zv_display_select_channel(ZV_DISPLAY *, u32 channel);
int zv_display_channel_mode(ZV_DISPLAY *, u32 window, u32 flags);
int zv_display_pos2channel(ZV_DISPLAY *, u32 x, u32 y);
int zv_display_motion_trace(ZV_DISPLAY *, u32 on);
int zv_display_zoom(ZV_DISPLAY *, u32 level, int x, int y);
int zv_display_pip(ZV_DISPLAY *, int channel, u32 x, u32 y);
int zv_display_pip_move(ZV_DISPLAY *, int dx, int dy);

#ifdef __cplusplus
}
#endif

#endif
