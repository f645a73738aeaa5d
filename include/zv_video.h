#ifndef ZV_VIDEO_H
#define ZV_VIDEO_H

#include "zv_type.h"

#ifdef __cplusplus
extern "C" {
#endif

int zv_set_video_config(HANDLE, u32 channel);
int zv_get_video_config(HANDLE, u32 channel);

#ifdef __cplusplus
}
#endif

#endif
