/**
 * @file zv_video.h
 * Sends and reads back the encoder settings of one channel. zv_EnableVideoRecordChannels() sends the
 * settings of all channels; these functions are for programs that manage single channels themselves.
 */
#ifndef ZV_VIDEO_H
#define ZV_VIDEO_H

#include "zv_type.h"

#ifdef __cplusplus
extern "C" {
#endif

/**
 * Sends a channel's stored settings to the encoder without checking the frame-rate budget. Sends the
 * quantiser range only if QPMinMaxEnable is set and 1 <= QPMin < QPMax <= 29; otherwise the encoder
 * keeps the range that it got last.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle; ZV_ERR_CHANNEL for a channel above 15
 *
 * Context: control thread; open. Blocks for half a millisecond.
 */
int zv_set_video_config(HANDLE handle, u32 channel);

/**
 * Reads scale, interval, GOP and quantiser of a channel from the encoder into its stored settings. Sets
 * `enable` to 1 if the channel has a scale, else to 0. An interval code without a ZV_INTERVAL_VALUE
 * becomes INTERVAL_ZV_INVALID. Two-field mode cannot be read back: settings sent with it come back with
 * another interval.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle; ZV_ERR_CHANNEL for a channel above 15
 *
 * Context: control thread; open. Does not block.
 */
int zv_get_video_config(HANDLE handle, u32 channel);

#ifdef __cplusplus
}
#endif

#endif
