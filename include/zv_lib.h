/**
 * @file zv_lib.h
 * The Zarvo Capture SDK: a card with 16 video channels and 4 audio inputs.
 *
 * Order of use: zv_Open(); zv_RegisterCallBack(), zv_SetVideoStandard(), zv_SetResolution(); for a
 * recording zv_SetVideoEncodeConfig() per channel, zv_EnableVideoRecordChannels(),
 * zv_EnableAudioChannels(), zv_Start(), zv_Stop(); at the end zv_Close().
 *
 * One card is open per process. A function with an int result answers ZV_OK or one of the statuses
 * named with it; on an error nothing has changed unless its comment says so. A function with a
 * status answers ZV_ERR_PARAM for a handle that is null, dead or not from zv_Open(), unless its comment
 * says otherwise, and for a null pointer where it needs a record. Channel masks have bit n for channel n.
 *
 * The "Context" of a function tells which thread may call it, in which state, and whether it blocks.
 * The words used there (control thread, closed, open, capturing, blocks) are explained in
 * docs/threading.md.
 */
#ifndef ZV_LIB_H
#define ZV_LIB_H

#include "zv_type.h"

#ifdef __cplusplus
extern "C" {
#endif

/**
 * Opens the card and brings it into a known state: NTSC, 720 pixels, one preview picture, neutral
 * picture properties, motion detection off, no channel encoded.
 *
 * @param handle  receives the handle; written on success only
 * @return ZV_OK; ZV_ERR_PARAM for a null @p handle; ZV_ERR_OPEN when a device node is missing or
 *         refused; ZV_ERR_ALREADY_OPEN; ZV_ERR_NO_MEMORY when a buffer or mapping is not to be had,
 *         with "Zarvo SDK: Open Error! Error Code = 3." printed
 *
 * Context: control thread; closed. Does not block.
 */
int zv_Open(HANDLE *handle);

/**
 * Closes the card and releases everything; the handle is dead afterwards. Turns the preview and
 * motion detection off. Call zv_Stop() and zv_DisableWatchDog() before; threads that still run are
 * ended first, but no stop command is sent for them to the encoder.
 *
 * @param handle  the open card; anything when no card is open, which is no error
 * @return ZV_OK, also when no card is open; ZV_ERR_PARAM for another handle while a card is open;
 *         ZV_ERR_CLOSE when closing a device node failed, or when called from a callback: the card
 *         then still counts as open, and another zv_Close() goes on with the nodes that are left
 *
 * Context: control thread; open or closed, not capturing, watchdog off. Blocks for the threads that
 * are still there.
 */
int zv_Close(HANDLE handle);

/**
 * Sets who receives encoded data. A null callback means: read and thrown away.
 *
 * @param handle  the open card
 * @param mpeg4   receives MPEG-4 frames; an intra frame begins with its 20-byte stream header
 * @param mjpeg   receives Motion-JPEG pictures, each a complete JPEG file
 * @param audio   receives 48-byte audio blocks of the enabled inputs
 * @return ZV_OK; ZV_ERR_PARAM
 *
 * Context: control thread; open or capturing: the next frame goes to the new callback, a call of the
 * old one may still be running. Does not block.
 */
int zv_RegisterCallBack(HANDLE handle, ZV_STREAM_CALLBACK mpeg4, ZV_STREAM_CALLBACK mjpeg,
                        ZV_STREAM_CALLBACK audio);

/**
 * Starts capture: frames and audio blocks of the enabled channels reach the callbacks.
 *
 * @param handle  the open card
 * @return ZV_OK, also when already capturing; ZV_ERR_PARAM; ZV_ERR_CONFIG when zv_CheckVideoEncodeConfig()
 *         refuses the stored settings; ZV_ERR_THREAD_CREATE after "Zarvo SDK: Start Error!
 *         Error Code = 12." and a full zv_Stop(), which wipes the encoder settings
 *
 * Context: control thread, not from a callback; open or capturing. Blocks for about a millisecond.
 */
int zv_Start(HANDLE handle);

/**
 * Stops capture. Disables all channels and audio inputs and wipes the encoder settings of all
 * channels: store them again before the next zv_Start(). No callback runs after it has returned.
 *
 * @param handle  the open card; anything when not capturing, which is no error
 * @return ZV_OK, also when not capturing; ZV_ERR_PARAM; ZV_ERR_THREAD_JOIN when a capture thread
 *         could not be joined, as when called from a callback
 *
 * Context: control thread, not from a callback; any state. Blocks for about 30 milliseconds and
 * until a running callback returns: take no lock here that a callback waits for.
 */
int zv_Stop(HANDLE handle);

/**
 * Tells the input width.
 *
 * @param handle  the open card
 * @return a ZV_RESOLUTION; 0 for a bad handle
 *
 * Context: any thread; open or capturing. Does not block.
 */
u32 zv_GetResolution(HANDLE handle);

/**
 * Sets the input width, sends the current standard again and lays the preview out anew.
 *
 * @param handle      the open card
 * @param resolution  a ZV_RESOLUTION, 0 or 1
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_RESOLUTION
 *
 * Context: control thread; open. Does not block.
 */
int zv_SetResolution(HANDLE handle, u32 resolution);

/**
 * Tells the video standard.
 *
 * @param handle  the open card
 * @return a ZV_VIDEO_STANDARD; 0 for a bad handle
 *
 * Context: any thread; open or capturing. Does not block.
 */
u32 zv_GetVideoStandard(HANDLE handle);

/**
 * Sets the video standard of inputs, encoder and display. A display that is running is opened again
 * with the new size, its zoom off and its layout applied.
 *
 * @param handle    the open card
 * @param standard  a ZV_VIDEO_STANDARD, 0 or 1
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_STANDARD
 *
 * Context: control thread; open. Does not block.
 */
int zv_SetVideoStandard(HANDLE handle, u32 standard);

/**
 * Chooses the display windows of the preview and turns its output on, or off for mask 0. Bit n is
 * window n, which shows channel n unless the focus channel was moved. Ends the mark, though not the
 * picture, of a picture-in-picture.
 *
 * @param handle  the open card
 * @param mask    windows, bits 0-15
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_CHANNEL when a bit above 15 is set
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_EnablePreviewChannels(HANDLE handle, u32 mask);

/**
 * Fetches the newest preview picture, packed UYVY.
 *
 * @param handle   the open card
 * @param picture  receives the picture, which stays the card's and is overwritten in time; left
 *                 alone unless there is one: a result from 1 to 0x240000 and a buffer the SDK knows
 * @return what the driver's read returned: bytes of the picture, 0 for none yet, negative on failure;
 *         -1 for a bad handle or a null @p picture
 *
 * Context: any thread; open or capturing. Blocks as long as the driver's read takes, longer
 * while another thread is in it.
 */
int zv_GetPreviewScreen(HANDLE handle, u8 **picture);

/**
 * Copies a channel's stored encoder settings out.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @param config   receives the settings
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_CHANNEL
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_GetVideoEncodeConfig(HANDLE handle, u32 channel, ZV_VIDEO_CONFIG *config);

/**
 * Stores a channel's encoder settings. The card gets them from zv_EnableVideoRecordChannels().
 *
 * @param handle   the open card
 * @param channel  0-15
 * @param config   the settings; stored even when ZV_ERR_CONFIG is returned
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_CHANNEL; ZV_ERR_CONFIG when `enable` is set without a scale
 *         (a line is printed) or two-field mode is asked for at another interval than 0
 *
 * Context: control thread; open. Does not block.
 */
int zv_SetVideoEncodeConfig(HANDLE handle, u32 channel, const ZV_VIDEO_CONFIG *config);

/**
 * Checks all stored settings against the card's budget: sixteen CIF channels at the full rate, where
 * a half-D1 picture counts as two and a D1 picture as four, and rates count in whole frames.
 *
 * @param handle  the open card
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_CONFIG over budget (a line is printed) or for two-field mode
 *         with D1 or at another interval than 0. A scale outside ZV_SCALE_VALUE is named in a
 *         printed line and weighs nothing
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_CheckVideoEncodeConfig(HANDLE handle);

/**
 * Enables exactly the channels of @p mask for encoding, checks the budget and sends all settings to
 * the card. The settings of the other channels are wiped.
 *
 * @param handle  the open card
 * @param mask    channels, bits 0-15
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_CHANNEL when a bit above 15 is set; ZV_ERR_CONFIG when a
 *         channel of the mask has no scale (a line is printed) or zv_CheckVideoEncodeConfig()
 *         refuses: nothing is sent, but the stored settings stay as changed so far
 *
 * Context: control thread; open. Blocks for about 10 milliseconds.
 */
int zv_EnableVideoRecordChannels(HANDLE handle, u32 mask);

/**
 * Enables exactly the audio inputs of @p mask; at once when capturing.
 *
 * @param handle  the open card
 * @param mask    inputs, bits 0-3
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_CHANNEL when a bit above 3 is set
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_EnableAudioChannels(HANDLE handle, u32 mask);

/**
 * Tells whether there is such an audio input; audio itself comes through the callback only.
 *
 * @param handle   the open card
 * @param channel  0-3
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_CHANNEL
 *
 * Context: any thread; open or capturing. Does not block.
 */
int zv_GetAudioStream(HANDLE handle, u32 channel);

/**
 * Tells the preview layout that was asked for last.
 *
 * @param handle  the open card
 * @return a ZV_VIDEO_MODE; 0 for a bad handle
 *
 * Context: control thread; open or capturing. Does not block.
 */
u32 zv_GetPreviewMode(HANDLE handle);

/**
 * Sets the preview layout. While zoom or a picture-in-picture is on, the picture stays as it is and
 * only the mode is stored.
 *
 * @param handle  the open card
 * @param mode    a ZV_VIDEO_MODE, 0-5
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_MODE
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_SetPreviewMode(HANDLE handle, u32 mode);

/**
 * Tells which channel is at the first display position, the large one of the 6- and 8-picture
 * layouts.
 *
 * @param handle  the open card
 * @return a channel, 0-15; 0 for a bad handle
 *
 * Context: control thread; open or capturing. Does not block.
 */
u32 zv_GetFocusChannel(HANDLE handle);

/**
 * Swaps a channel into the first display position. The windows follow with the next layout.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_CHANNEL, also when no display position carries the channel
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_SetFocusChannel(HANDLE handle, u32 channel);

/**
 * Shows the channel number in a channel's encoded picture.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_CHANNEL
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_EnableVideoChannelNumber(HANDLE handle, u32 channel);

/**
 * Hides the channel number in a channel's encoded picture.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_CHANNEL
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_DisableVideoChannelNumber(HANDLE handle, u32 channel);

/**
 * Reads a channel's picture properties from its video decoder.
 *
 * @param handle    the open card
 * @param channel   0-15
 * @param property  receives user units; a hue between two register steps reads up to 2 degrees off
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_CHANNEL
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_GetVideoProperty(HANDLE handle, u32 channel, ZV_VIDEO_PROPERTY *property);

/**
 * Sets a channel's picture properties, for preview and recording.
 *
 * @param handle    the open card
 * @param channel   0-15
 * @param property  hue -180 to 180, made even toward zero in this record; saturation and contrast
 *                  0 to 200; brightness -25 to 25
 * @return ZV_OK; ZV_ERR_CHANNEL; ZV_ERR_PARAM, also for a value out of range: nothing is written then
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_SetVideoProperty(HANDLE handle, u32 channel, ZV_VIDEO_PROPERTY *property);

/**
 * Tells a channel's motion threshold as last set, or as the card had it when it was opened.
 *
 * @param handle       the open card
 * @param channel      0-15
 * @param sensitivity  receives 0-0xFFFF
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_CHANNEL
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_GetMotionSensitivity(HANDLE handle, u32 channel, u32 *sensitivity);

/**
 * Sets the motion threshold of all blocks of a channel; areas marked before are lost.
 *
 * @param handle       the open card
 * @param channel      0-15
 * @param sensitivity  0-0xFFFF; 0xFFFF never reports motion
 * @return ZV_OK; ZV_ERR_CHANNEL; ZV_ERR_PARAM, also for a value out of range; ZV_ERR_NO_MEMORY
 *         without a buffer for the map; ZV_ERR_DEVICE when the driver refused the map. With the last
 *         two the value is stored nevertheless
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_SetMotionSensitivity(HANDLE handle, u32 channel, u32 sensitivity);

/**
 * Takes the 16 x 16-pixel blocks of an area out of a channel's motion detection, or in again.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @param rect     pixels and lines inside the input picture; one without extent changes nothing
 * @param mark     non-zero: out; 0: in, with the channel's sensitivity
 * @return ZV_OK; ZV_ERR_CHANNEL; ZV_ERR_PARAM, also for a rectangle outside the picture or reversed;
 *         ZV_ERR_NO_MEMORY without a buffer for the map; ZV_ERR_DEVICE when the driver refused the map
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_MarkMotionArea(HANDLE handle, u32 channel, const ZV_RECT *rect, u32 mark);

/**
 * Starts motion detection on all channels and shows its marks on the preview.
 *
 * @param handle  the open card
 * @return ZV_OK; ZV_ERR_PARAM
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_StartMotionDetection(HANDLE handle);

/**
 * Stops motion detection on all channels and hides its marks.
 *
 * @param handle  the open card
 * @return ZV_OK; ZV_ERR_PARAM
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_StopMotionDetection(HANDLE handle);

/**
 * Tells which channels show motion now; channels without video never do.
 *
 * @param handle  the open card
 * @return channel mask; 0 for a bad handle
 *
 * Context: any thread; open or capturing: frames that follow carry these bits until the next poll
 * of the video data thread. Does not block.
 */
u32 zv_GetMotionStatus(HANDLE handle);

/**
 * Blanks a rectangle of a channel's picture; an empty one takes the mask away.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @param rect     pixels and lines inside the input picture; the card rounds to multiples of 8
 * @return ZV_OK; ZV_ERR_CHANNEL; ZV_ERR_PARAM, also for a rectangle outside the picture or reversed
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_SetShieldRect(HANDLE handle, u32 channel, const ZV_RECT *rect);

/**
 * Reads a channel's mask from the card.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @param rect     receives the rectangle, all edges multiples of 8
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_CHANNEL
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_GetShieldRect(HANDLE handle, u32 channel, ZV_RECT *rect);

/**
 * Tells which channels have lost their video.
 *
 * @param handle  the open card
 * @return channel mask; all 16 bits for a bad handle
 *
 * Context: any thread; open or capturing. Does not block.
 */
u32 zv_GetVideoStatus(HANDLE handle);

/**
 * Tells which audio inputs have no signal.
 *
 * @param handle  the open card
 * @return input mask, bits 0-3; all 4 bits for a bad handle
 *
 * Context: any thread; open or capturing. Does not block.
 */
u32 zv_GetAudioStatus(HANDLE handle);

/**
 * Tells the board revision.
 *
 * @param handle  the open card
 * @return 0, 1 or 2; 3 when the board's answer is unknown or missing, and for a bad handle
 *
 * Context: any thread; open or capturing. Does not block.
 */
u32 zv_GetHardwareVersion(HANDLE handle);

/**
 * Starts the board's watchdog and a thread that feeds it every 30 seconds: when the process dies or
 * hangs, the board resets the machine. A board that does not answer ends the thread with a line on
 * standard output.
 *
 * @param handle  the open card
 * @return ZV_OK, also when it runs already; ZV_ERR_PARAM; ZV_ERR_THREAD_CREATE
 *
 * Context: control thread; open or capturing. Blocks only for a thread that is just ending.
 */
int zv_EnableWatchDog(HANDLE handle);

/**
 * Stops the watchdog and its thread.
 *
 * @param handle  the open card
 * @return ZV_OK, also when it does not run; ZV_ERR_PARAM; ZV_ERR_THREAD_JOIN; ZV_ERR_DEVICE when
 *         the board does not confirm: the watchdog may still be running
 *
 * Context: control thread; open or capturing. Blocks for a few milliseconds, or as long as the
 * driver holds the thread in a command.
 */
int zv_DisableWatchDog(HANDLE handle);

/**
 * Reads a codec-chip register and prints it.
 *
 * @param handle  the open card
 * @param reg     register address, any u32; what the driver does not give reads as 0
 * @param value   receives the value
 * @return ZV_OK; ZV_ERR_PARAM
 *
 * Context: any thread; open or capturing. Does not block.
 */
int zv_GetTarnRegisterValue(HANDLE handle, u32 reg, u32 *value);

/**
 * Writes a codec-chip register, reads it back and prints what it reads.
 *
 * @param handle  the open card
 * @param reg     register address, any u32; what the driver does not give reads as 0
 * @param value   the value to write; not changed
 * @return ZV_OK; ZV_ERR_PARAM
 *
 * Context: any thread; open or capturing. Does not block.
 */
int zv_SetTarnRegisterValue(HANDLE handle, u32 reg, const u32 *value);

/**
 * Reads a register of a video decoder and prints it.
 *
 * @param handle  the open card
 * @param chip    decoder, 0-3; channels 4k to 4k + 3 are on chip k
 * @param reg     register number, any u8; what the driver does not give reads as 0
 * @param value   receives the value
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_DEVICE for a chip above 3
 *
 * Context: any thread; open or capturing. Does not block.
 */
int zv_GetTW2815RegisterValue(HANDLE handle, u8 chip, u8 reg, u8 *value);

/**
 * Writes a register of a video decoder, reads it back and prints what it reads.
 *
 * @param handle  the open card
 * @param chip    decoder, 0-3
 * @param reg     register number, any u8; what the driver does not give reads as 0
 * @param value   the value to write; not changed
 * @return ZV_OK; ZV_ERR_PARAM; ZV_ERR_DEVICE for a chip above 3
 *
 * Context: any thread; open or capturing. Does not block.
 */
int zv_SetTW2815RegisterValue(HANDLE handle, u8 chip, u8 reg, const u8 *value);

#ifdef __cplusplus
}
#endif

#endif
