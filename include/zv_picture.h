/**
 * @file zv_picture.h
 * What the pictures show: preview, focus channel, channel numbers, picture properties, motion detection and
 * privacy masks. zv_lib.h includes this header and explains handles, statuses, channel masks and contexts.
 */
#ifndef ZV_PICTURE_H
#define ZV_PICTURE_H

#include "zv_type.h"

#ifdef __cplusplus
extern "C" {
#endif

/**
 * Enables exactly the preview windows of @p mask and turns the preview output on; mask 0 turns the
 * output off. Bit n is window n, which shows channel n unless zv_SetFocusChannel() has swapped it.
 * Clears ZV_WINDOW_PIP on a picture-in-picture window; the window stays on screen.
 *
 * @param handle  the open card
 * @param mask    windows, bits 0-15
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle; ZV_ERR_CHANNEL when a bit above 15 is set
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_EnablePreviewChannels(HANDLE handle, u32 mask);

/**
 * Reads the newest preview picture, packed UYVY.
 *
 * @param handle   the open card
 * @param picture  receives a pointer into the card's buffer, valid until the card overwrites it; set
 *                 only when the result is 1 to 0x240000 and the driver named a known buffer
 * @return the result of the driver's read: bytes of the picture, 0 when there is none yet, negative on
 *         failure; -1 for a bad handle or a null @p picture
 *
 * Context: any thread; open or capturing. Blocks for the driver's read, and while another thread is
 * inside this function.
 */
int zv_GetPreviewScreen(HANDLE handle, u8 **picture);

/**
 * Returns the stored preview mode: the layout that was set last, whether or not it has been applied.
 *
 * @param handle  the open card
 * @return a ZV_VIDEO_MODE; 0 for a bad handle
 *
 * Context: control thread; open or capturing. Does not block.
 */
u32 zv_GetPreviewMode(HANDLE handle);

/**
 * Stores the preview mode and applies its layout. While zoom or a picture-in-picture is on, only stores
 * the mode: the preview does not change. If the stored mode is then not the 1-picture layout,
 * zv_display_zoom() and zv_display_pip() refuse, so neither can be turned off until mode 0 is set again.
 *
 * @param handle  the open card
 * @param mode    a ZV_VIDEO_MODE, 0-5
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle; ZV_ERR_MODE for a mode above 5
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_SetPreviewMode(HANDLE handle, u32 mode);

/**
 * Returns the channel in the first display position, which is the large window of the 6- and 8-picture
 * layouts.
 *
 * @param handle  the open card
 * @return a channel, 0-15; 0 for a bad handle
 *
 * Context: control thread; open or capturing. Does not block.
 */
u32 zv_GetFocusChannel(HANDLE handle);

/**
 * Swaps a channel with the channel in the first display position. The routing in the card changes at once;
 * depending on the card, the preview shows the swap at once or only with the next zv_SetPreviewMode(), which
 * sends the new window records.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle; ZV_ERR_CHANNEL for a channel above 15, or when no display
 *         position shows the channel
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_SetFocusChannel(HANDLE handle, u32 channel);

/**
 * Shows the channel number in a channel's encoded picture.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle; ZV_ERR_CHANNEL for a channel above 15
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_EnableVideoChannelNumber(HANDLE handle, u32 channel);

/**
 * Hides the channel number in a channel's encoded picture.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle; ZV_ERR_CHANNEL for a channel above 15
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_DisableVideoChannelNumber(HANDLE handle, u32 channel);

/**
 * Reads a channel's picture properties from its video decoder.
 *
 * @param handle    the open card
 * @param channel   0-15
 * @param property  receives user units; the hue may differ by 2 degrees from the hue that was set
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle or a null @p property; ZV_ERR_CHANNEL for a channel above
 *         15
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_GetVideoProperty(HANDLE handle, u32 channel, ZV_VIDEO_PROPERTY *property);

/**
 * Sets a channel's picture properties, for preview and recording.
 *
 * @param handle    the open card
 * @param channel   0-15
 * @param property  hue -180 to 180 (the function rounds it toward zero to an even number and writes that
 *                  back into the record); saturation and contrast 0 to 200; brightness -25 to 25
 * @return ZV_OK; ZV_ERR_CHANNEL for a channel above 15; ZV_ERR_PARAM for a bad handle, a null
 *         @p property or a value out of range
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_SetVideoProperty(HANDLE handle, u32 channel, ZV_VIDEO_PROPERTY *property);

/**
 * Returns a channel's stored motion threshold: the value set last, or the value the card had in
 * zv_Open(), 0 if the card did not report one.
 *
 * @param handle       the open card
 * @param channel      0-15
 * @param sensitivity  receives 0-0xFFFF
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle or a null @p sensitivity; ZV_ERR_CHANNEL for a channel
 *         above 15
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_GetMotionSensitivity(HANDLE handle, u32 channel, u32 *sensitivity);

/**
 * Sets the motion threshold of all blocks of a channel. This overwrites the areas that
 * zv_MarkMotionArea() has excluded.
 *
 * @param handle       the open card
 * @param channel      0-15
 * @param sensitivity  0-0xFFFF; 0xFFFF never reports motion
 * @return ZV_OK; ZV_ERR_CHANNEL for a channel above 15; ZV_ERR_PARAM for a bad handle or a value out of
 *         range; ZV_ERR_NO_MEMORY when there is no buffer for the map; ZV_ERR_DEVICE when the driver
 *         refuses the map. ZV_ERR_NO_MEMORY and ZV_ERR_DEVICE leave the new value stored
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_SetMotionSensitivity(HANDLE handle, u32 channel, u32 sensitivity);

/**
 * Excludes the 16 x 16 blocks of an area from motion detection, or includes them again with the
 * channel's threshold. The number of blocks comes from width and height alone, so an area that is not
 * aligned to 16 pixels can miss its last block.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @param rect     pixels and lines inside the input picture; an empty rectangle changes nothing
 * @param mark     non-zero: exclude; 0: include
 * @return ZV_OK; ZV_ERR_CHANNEL for a channel above 15; ZV_ERR_PARAM for a bad handle, a null @p rect, or
 *         a rectangle that is reversed or outside the picture; ZV_ERR_NO_MEMORY when there is no buffer
 *         for the map; ZV_ERR_DEVICE when the driver refuses the map
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_MarkMotionArea(HANDLE handle, u32 channel, const ZV_RECT *rect, u32 mark);

/**
 * Starts motion detection on all channels and shows motion marks on the preview.
 *
 * @param handle  the open card
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_StartMotionDetection(HANDLE handle);

/**
 * Stops motion detection on all channels and hides the motion marks.
 *
 * @param handle  the open card
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_StopMotionDetection(HANDLE handle);

/**
 * Returns the channels that show motion now, without the channels that have lost their video.
 *
 * @param handle  the open card
 * @return channel mask; 0 for a bad handle
 *
 * Context: any thread; open or capturing. While capturing, this also replaces the motion bits that
 * frames are tagged with, until the video data thread polls again. Does not block.
 */
u32 zv_GetMotionStatus(HANDLE handle);

/**
 * Sets a channel's privacy mask: the card blanks this rectangle of the picture. An empty rectangle
 * removes the mask.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @param rect     pixels and lines inside the input picture; the card rounds them to multiples of 8
 * @return ZV_OK; ZV_ERR_CHANNEL for a channel above 15; ZV_ERR_PARAM for a bad handle, a null @p rect, or
 *         a rectangle that is reversed or outside the picture
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_SetShieldRect(HANDLE handle, u32 channel, const ZV_RECT *rect);

/**
 * Reads a channel's privacy mask from the card.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @param rect     receives the rectangle, all edges multiples of 8
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle or a null @p rect; ZV_ERR_CHANNEL for a channel above 15
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_GetShieldRect(HANDLE handle, u32 channel, ZV_RECT *rect);

#ifdef __cplusplus
}
#endif

#endif
