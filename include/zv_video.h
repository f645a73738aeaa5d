/**
 * @file zv_video.h
 * One channel's encoder settings, to the card and back. zv_EnableVideoRecordChannels() sends the
 * settings of all channels; these are for programs that look after single channels themselves.
 */
#ifndef ZV_VIDEO_H
#define ZV_VIDEO_H

#include "zv_type.h"

#ifdef __cplusplus
extern "C" {
#endif

/**
 * Sends a channel's stored settings to the encoder, without any check of the budget. A quantiser
 * range is sent only if 1 <= QPMin < QPMax <= 29; one sent earlier stays in force until the next.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle; ZV_ERR_CHANNEL
 *
 * Context: control thread; open. Blocks for half a millisecond.
 */
int zv_set_video_config(HANDLE handle, u32 channel);

/**
 * Reads scale, interval, GOP and quantiser of a channel back from the encoder into its stored
 * settings, and sets `enable` when the channel is encoded. An interval no ZV_INTERVAL_VALUE stands
 * for becomes INTERVAL_ZV_INVALID; one sent in two-field mode reads as if it were sent without.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle; ZV_ERR_CHANNEL
 *
 * Context: control thread; open. Does not block.
 */
int zv_get_video_config(HANDLE handle, u32 channel);

#ifdef __cplusplus
}
#endif

#endif
