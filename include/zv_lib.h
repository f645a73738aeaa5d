/**
 * @file zv_lib.h
 * The Zarvo Capture SDK: a card with 16 video channels and 4 audio inputs. This header also brings in
 * zv_picture.h: preview, picture properties, motion detection and privacy masks.
 *
 * Order of use: zv_Open(), zv_RegisterCallBack(), zv_SetVideoStandard(), zv_SetResolution(); for a
 * recording zv_SetVideoEncodeConfig() for each channel, zv_EnableVideoRecordChannels(),
 * zv_EnableAudioChannels(), zv_Start(), zv_Stop(); at the end zv_Close().
 *
 * A process has one card open at a time. A function that returns an int returns ZV_OK or one of the statuses
 * that its comment lists; when it fails, it changes nothing unless its comment says otherwise. A function
 * that returns a status returns ZV_ERR_PARAM for a null record pointer and, unless its comment says
 * otherwise, for a bad handle (null, closed, or not from zv_Open()). Bit n of a channel mask is channel n.
 *
 * The "Context" of a function names the threads that may call it, the states it is allowed in, and
 * whether it blocks. docs/threading.md explains the words that it uses (control thread, any thread,
 * closed, open, capturing, blocks).
 */
#ifndef ZV_LIB_H
#define ZV_LIB_H

#include "zv_picture.h"
#include "zv_type.h"

#ifdef __cplusplus
extern "C" {
#endif

/**
 * Opens the card. Writes registers 0x72, 0x73 and 0x74 of decoder chip 0, clears bits 16-31 of codec
 * register 0x260 (no motion detection on any channel) and sets codec register 0x268 to 0xFFFF. The card
 * keeps everything else that an earlier program has set, until it loses power: standard and width, encoder
 * settings, layout, focus channel, picture properties, privacy masks, motion thresholds.
 *
 * The SDK reads only the motion thresholds. It assumes NTSC, 720 pixels, the 1-picture layout, channel n in
 * display position n and no channel enabled, whatever the card has. Call zv_SetVideoStandard() and
 * zv_SetResolution() right after opening: else stream headers and pictures can differ in size.
 *
 * @param handle  receives the handle; written only on success
 * @return ZV_OK; ZV_ERR_PARAM for a null @p handle; ZV_ERR_OPEN when a device node is missing or
 *         cannot be opened; ZV_ERR_ALREADY_OPEN when this process has a card open; ZV_ERR_NO_MEMORY when
 *         a buffer or mapping cannot be allocated: prints "Zarvo SDK: Open Error! Error Code = 3."
 *
 * Context: control thread; closed. Does not block.
 */
int zv_Open(HANDLE *handle);

/**
 * Closes the card and releases all memory; the handle is invalid afterwards. Turns the preview and
 * motion detection off. Call zv_Stop() and zv_DisableWatchDog() before. Threads that still run are ended
 * first, but the encoder gets no stop command.
 *
 * @param handle  the open card; ignored when no card is open
 * @return ZV_OK, also when no card is open; ZV_ERR_PARAM for a bad handle while a card is open;
 *         ZV_ERR_CLOSE when a device node cannot be closed, or when called from a callback: capture and
 *         watchdog have ended, the card still counts as open, and another zv_Close() closes the
 *         remaining nodes
 *
 * Context: control thread; closed or open, not capturing, watchdog off. Blocks until the threads that
 * still run have ended.
 */
int zv_Close(HANDLE handle);

/**
 * Sets the functions that receive encoded data. For a null callback the SDK reads the data and discards
 * it.
 *
 * @param handle  the open card
 * @param mpeg4   receives MPEG-4 frames; an intra frame begins with its 20-byte stream header
 * @param mjpeg   receives Motion-JPEG pictures, each a complete JPEG file. The data end at the last byte
 *                0xD9 that the card delivered, normally the end of the EOI marker; a picture without an
 *                EOI can therefore end early at a stray 0xD9, and without any 0xD9 it is discarded
 * @param audio   receives 48-byte audio blocks of the enabled inputs
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle
 *
 * Context: control thread; open or capturing. While capturing, the next frame goes to the new callback,
 * but a call of the old callback may still be running. Does not block.
 */
int zv_RegisterCallBack(HANDLE handle, ZV_STREAM_CALLBACK mpeg4, ZV_STREAM_CALLBACK mjpeg,
                        ZV_STREAM_CALLBACK audio);

/**
 * Starts capture: the callbacks receive frames and audio blocks of the enabled channels.
 *
 * @param handle  the open card
 * @return ZV_OK, also when already capturing; ZV_ERR_PARAM for a bad handle; ZV_ERR_CONFIG when
 *         zv_CheckVideoEncodeConfig() refuses the stored settings; ZV_ERR_THREAD_CREATE when a thread
 *         cannot be created: prints "Zarvo SDK: Start Error! Error Code = 12." and does all of zv_Stop(),
 *         which wipes the encoder settings
 *
 * Context: control thread, not from a callback; open or capturing. Blocks about 1 ms; if a callback has
 * called zv_Stop(), also until that callback returns.
 */
int zv_Start(HANDLE handle);

/**
 * Stops capture. Disables all channels and audio inputs and wipes the encoder settings of all
 * channels: store them again before the next zv_Start(). After it has returned ZV_OK, no callback runs.
 *
 * @param handle  the open card; ignored when not capturing
 * @return ZV_OK, also when not capturing; ZV_ERR_PARAM for a bad handle while capturing;
 *         ZV_ERR_THREAD_JOIN when a capture thread cannot be joined, for example when called from a
 *         callback: capture has stopped and the settings are wiped all the same; the next zv_Start() or
 *         zv_Close() joins the thread
 *
 * Context: control thread, not from a callback; any state. Blocks about 30 ms plus the rest of a running
 * callback: do not hold a lock that a callback may wait for.
 */
int zv_Stop(HANDLE handle);

/**
 * Returns the input width.
 *
 * @param handle  the open card
 * @return a ZV_RESOLUTION; 0 for a bad handle
 *
 * Context: any thread; open or capturing. Does not block.
 */
u32 zv_GetResolution(HANDLE handle);

/**
 * Sets the input width. Sends the current video standard again, as zv_SetVideoStandard() does, and
 * applies the preview mode to the new width, as zv_SetPreviewMode() does.
 *
 * @param handle      the open card
 * @param resolution  a ZV_RESOLUTION, 0 or 1
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle; ZV_ERR_RESOLUTION for another @p resolution
 *
 * Context: control thread; open. Does not block.
 */
int zv_SetResolution(HANDLE handle, u32 resolution);

/**
 * Returns the video standard.
 *
 * @param handle  the open card
 * @return a ZV_VIDEO_STANDARD; 0 for a bad handle
 *
 * Context: any thread; open or capturing. Does not block.
 */
u32 zv_GetVideoStandard(HANDLE handle);

/**
 * Sets the video standard of inputs, encoder and display. If the display is running (the first zv_Start() at
 * the latest starts it), opens it again as zv_display_open() does: reads the new size, turns zoom off and
 * applies the stored preview mode. While a picture-in-picture is on, or zoom is on and the stored mode is not
 * the 1-picture layout, zoom stays as it is and the stored mode is not applied: the windows keep the places
 * they had.
 *
 * @param handle    the open card
 * @param standard  a ZV_VIDEO_STANDARD, 0 or 1
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle; ZV_ERR_STANDARD for another @p standard
 *
 * Context: control thread; open. Does not block.
 */
int zv_SetVideoStandard(HANDLE handle, u32 standard);

/**
 * Copies a channel's stored encoder settings into @p config.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @param config   receives the settings
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle or a null @p config; ZV_ERR_CHANNEL for a channel above 15
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_GetVideoEncodeConfig(HANDLE handle, u32 channel, ZV_VIDEO_CONFIG *config);

/**
 * Stores a channel's encoder settings. zv_EnableVideoRecordChannels() sends them to the card.
 *
 * @param handle   the open card
 * @param channel  0-15
 * @param config   the settings; stored even when ZV_ERR_CONFIG is returned
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle or a null @p config; ZV_ERR_CHANNEL for a channel above
 *         15; ZV_ERR_CONFIG when `enable` is set without a scale (prints a line), or when two-field mode
 *         is set with an interval other than 0
 *
 * Context: control thread; open. Does not block.
 */
int zv_SetVideoEncodeConfig(HANDLE handle, u32 channel, const ZV_VIDEO_CONFIG *config);

/**
 * Checks the stored settings of all channels, enabled or not, against the card's frame-rate budget:
 * sixteen CIF channels at the full rate. A half-D1 picture counts as two CIF pictures, a D1 picture as
 * four; two-field mode counts twice; a rate counts as a whole number of frames a second, rounded down.
 *
 * @param handle  the open card
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle; ZV_ERR_CONFIG over budget (prints a line), or for
 *         two-field mode with D1 or with an interval other than 0. A scale outside ZV_SCALE_VALUE prints
 *         a line and counts as 0
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_CheckVideoEncodeConfig(HANDLE handle);

/**
 * Enables exactly the channels of @p mask for encoding, wipes the settings of the other channels, checks
 * the budget and sends the settings of all channels to the card.
 *
 * @param handle  the open card
 * @param mask    channels, bits 0-15
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle; ZV_ERR_CHANNEL when a bit above 15 is set; ZV_ERR_CONFIG
 *         when a channel of the mask has no scale (prints a line) or zv_CheckVideoEncodeConfig()
 *         refuses: nothing is sent, but the stored settings stay changed (`enable` set on the channels of the
 *         mask, the others wiped): on all channels if zv_CheckVideoEncodeConfig() refuses, else on those up
 * to the channel without a scale
 *
 * Context: control thread; open. Blocks about 10 ms.
 */
int zv_EnableVideoRecordChannels(HANDLE handle, u32 mask);

/**
 * Enables exactly the audio inputs of @p mask. While capturing, this takes effect at the next audio
 * block.
 *
 * @param handle  the open card
 * @param mask    inputs, bits 0-3
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle; ZV_ERR_CHANNEL when a bit above 3 is set
 *
 * Context: control thread; open or capturing. Does not block.
 */
int zv_EnableAudioChannels(HANDLE handle, u32 mask);

/**
 * Checks the number of an audio input. Has no other effect: only the callback receives audio.
 *
 * @param handle   the open card
 * @param channel  0-3
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle; ZV_ERR_CHANNEL for an input above 3
 *
 * Context: any thread; open or capturing. Does not block.
 */
int zv_GetAudioStream(HANDLE handle, u32 channel);

/**
 * Returns the channels that have lost their video.
 *
 * @param handle  the open card
 * @return channel mask; all 16 bits for a bad handle
 *
 * Context: any thread; open or capturing. Does not block.
 */
u32 zv_GetVideoStatus(HANDLE handle);

/**
 * Returns the audio inputs that have no signal.
 *
 * @param handle  the open card
 * @return input mask, bits 0-3; all 4 bits for a bad handle
 *
 * Context: any thread; open or capturing. Does not block.
 */
u32 zv_GetAudioStatus(HANDLE handle);

/**
 * Returns the board revision.
 *
 * @param handle  the open card
 * @return 0, 1 or 2; 3 for a bad handle, or when the board does not reply or its reply is unknown
 *
 * Context: any thread; open or capturing. Does not block.
 */
u32 zv_GetHardwareVersion(HANDLE handle);

/**
 * Starts the board's watchdog and a thread that feeds it every 30 seconds. When the feeding stops without
 * zv_DisableWatchDog() or zv_Close(), for example because the process is killed, the board resets the
 * machine. The thread does not notice when another thread of the process hangs. If the board does not
 * reply, the thread prints a line, turns the watchdog off and ends.
 *
 * @param handle  the open card
 * @return ZV_OK, also when it already runs; ZV_ERR_PARAM for a bad handle; ZV_ERR_THREAD_CREATE when the
 *         thread cannot be created
 *
 * Context: control thread; open or capturing. Blocks only while an earlier watchdog thread is still
 * ending.
 */
int zv_EnableWatchDog(HANDLE handle);

/**
 * Stops the watchdog and its thread.
 *
 * @param handle  the open card
 * @return ZV_OK, also when it does not run; ZV_ERR_PARAM for a bad handle; ZV_ERR_THREAD_JOIN when the
 *         thread cannot be joined; ZV_ERR_DEVICE when the board does not confirm the stop: the watchdog
 *         may still be running
 *
 * Context: control thread; open or capturing. Blocks for a few milliseconds, or until the driver
 * finishes a command of the thread.
 */
int zv_DisableWatchDog(HANDLE handle);

/**
 * Reads a codec-chip register and prints it.
 *
 * @param handle  the open card
 * @param reg     register address, any u32; reads as 0 when the driver does not answer
 * @param value   receives the value
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle or a null @p value
 *
 * Context: any thread; open or capturing. Does not block.
 */
int zv_GetTarnRegisterValue(HANDLE handle, u32 reg, u32 *value);

/**
 * Writes a codec-chip register, reads it back and prints the value read.
 *
 * @param handle  the open card
 * @param reg     register address, any u32; reads as 0 when the driver does not answer
 * @param value   the value to write; not changed
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle or a null @p value
 *
 * Context: any thread; open or capturing. Does not block.
 */
int zv_SetTarnRegisterValue(HANDLE handle, u32 reg, const u32 *value);

/**
 * Reads a register of a video decoder and prints it.
 *
 * @param handle  the open card
 * @param chip    decoder, 0-3; channels 4k to 4k + 3 are on chip k
 * @param reg     register number, any u8; reads as 0 when the driver does not answer
 * @param value   receives the value
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle or a null @p value; ZV_ERR_DEVICE for a chip above 3
 *
 * Context: any thread; open or capturing. Does not block.
 */
int zv_GetTW2815RegisterValue(HANDLE handle, u8 chip, u8 reg, u8 *value);

/**
 * Writes a register of a video decoder, reads it back and prints the value read.
 *
 * @param handle  the open card
 * @param chip    decoder, 0-3; channels 4k to 4k + 3 are on chip k
 * @param reg     register number, any u8; reads as 0 when the driver does not answer
 * @param value   the value to write; not changed
 * @return ZV_OK; ZV_ERR_PARAM for a bad handle or a null @p value; ZV_ERR_DEVICE for a chip above 3
 *
 * Context: any thread; open or capturing. Does not block.
 */
int zv_SetTW2815RegisterValue(HANDLE handle, u8 chip, u8 reg, const u8 *value);

#ifdef __cplusplus
}
#endif

#endif
