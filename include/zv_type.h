/**
 * @file zv_type.h
 * Types, enumerations, records and status codes of the Zarvo Capture SDK.
 *
 * The header compiles on its own as C11 and as C++20. Every enumerator has an explicit value: combo boxes,
 * stored settings and the card depend on the numbers.
 */
#ifndef ZV_TYPE_H
#define ZV_TYPE_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef uint8_t u8;   /**< unsigned, 8 bits */
typedef uint16_t u16; /**< unsigned, 16 bits */
typedef uint32_t u32; /**< unsigned, 32 bits */
typedef int32_t i32;  /**< signed, 32 bits */

/** An open card. Opaque; zv_Open() creates it, zv_Close() makes it invalid. */
typedef void *HANDLE;

/** Number of video channels of a card; channels are numbered 0 to ZV_CHANNELS - 1. */
#define ZV_CHANNELS 16u
/** Number of audio inputs of a card; inputs are numbered 0 to ZV_AUDIO_CHANNELS - 1. */
#define ZV_AUDIO_CHANNELS 4u

/** Bit of the callback's flags: the channel has lost its video. */
#define ZV_FLAG_VIDEO_LOSS 0x1
/** Bit of the callback's flags: motion was detected on the channel. */
#define ZV_FLAG_MOTION 0x10000

/**
 * Receives encoded data on a thread of the SDK.
 *
 * @param channel  video channel 0-15, or audio input 0-3
 * @param data     the frame or audio block; valid only until the callback returns
 * @param length   number of bytes at @p data
 * @param flags    ZV_FLAG_MOTION and ZV_FLAG_VIDEO_LOSS of a video channel; 0 for audio
 *
 * Context: video callbacks run on the video data thread, the audio callback on the audio data thread; the
 * two threads run at the same time. A slow callback delays the frames that follow. A callback may call
 * functions whose Context says any thread. It must not call zv_Start(), zv_Stop() or zv_Close(), which
 * belong to the control thread.
 */
typedef void (*ZV_STREAM_CALLBACK)(u32 channel, u8 *data, i32 length, i32 flags);

/** Status of an SDK call. The numbers 4, 5 and 13 are not used. */
enum {
  ZV_OK = 0,                 /**< the call succeeded */
  ZV_ERR_OPEN = 1,           /**< a device node could not be opened */
  ZV_ERR_ALREADY_OPEN = 2,   /**< a card is already open in this process */
  ZV_ERR_NO_MEMORY = 3,      /**< a buffer could not be allocated or a region could not be mapped */
  ZV_ERR_MODE = 6,           /**< preview mode outside ZV_VIDEO_MODE 0-5 */
  ZV_ERR_CHANNEL = 7,        /**< channel number or channel mask out of range */
  ZV_ERR_STANDARD = 8,       /**< video standard other than 0 or 1 */
  ZV_ERR_RESOLUTION = 9,     /**< resolution other than 0 or 1 */
  ZV_ERR_CONFIG = 10,        /**< encoder configuration invalid or over the frame-rate budget */
  ZV_ERR_PARAM = 11,         /**< a value out of its range, a bad handle or a null pointer */
  ZV_ERR_THREAD_CREATE = 12, /**< a thread could not be created */
  ZV_ERR_THREAD_JOIN = 14,   /**< a thread could not be joined */
  ZV_ERR_CLOSE = 15,         /**< closing a device node failed */
  ZV_ERR_DEVICE = 16         /**< the driver or the hardware refused or did not reply */
};

/** Video standard of all inputs. */
typedef enum ZV_VIDEO_STANDARD {
  VIDEO_STANDARD_ZV_NTSC = 0, /**< 480 lines, 30000/1001 frames a second */
  VIDEO_STANDARD_ZV_PAL = 1,  /**< 576 lines, 25 frames a second */
  VIDEO_STANDARD_ZV_INVALID = 2
} ZV_VIDEO_STANDARD;

/** Width of the input picture. */
typedef enum ZV_RESOLUTION {
  RESOLUTION_ZV_720 = 0, /**< 720 pixels */
  RESOLUTION_ZV_704 = 1, /**< 704 pixels */
  RESOLUTION_ZV_INVALID = 2
} ZV_RESOLUTION;

/** Layout of the preview picture. */
typedef enum ZV_VIDEO_MODE {
  MUX_MODE_ZV_1CH = 0,  /**< one picture */
  MUX_MODE_ZV_4CH = 1,  /**< 2 x 2 pictures */
  MUX_MODE_ZV_6CH = 2,  /**< a large picture and five small ones */
  MUX_MODE_ZV_8CH = 3,  /**< a large picture and seven small ones */
  MUX_MODE_ZV_9CH = 4,  /**< 3 x 3 pictures */
  MUX_MODE_ZV_16CH = 5, /**< 4 x 4 pictures */
  MUX_MODE_ZV_INVALID = 6
} ZV_VIDEO_MODE;

/** Video codec of a channel. */
typedef enum ZV_VIDEO_CODEC { VIDEO_CODEC_ZV_MPEG4 = 0, VIDEO_CODEC_ZV_MJPEG = 1 } ZV_VIDEO_CODEC;

/** Size of an encoded picture, W = input width, H = lines of the standard. */
typedef enum ZV_SCALE_VALUE {
  SCALE_ZV_NO_ENCODE = 0, /**< the channel is not encoded */
  SCALE_ZV_HALF_D1 = 1,   /**< W x H/2, one field */
  SCALE_ZV_CIF = 2,       /**< 352 x H/2, one field */
  SCALE_ZV_D1 = 3,        /**< W x H, interlaced */
  SCALE_ZV_INVALID = 4
} ZV_SCALE_VALUE;

/** Whether half-height pictures are encoded from one or both fields of a frame. */
typedef enum ZV_TWOFIELD_MODE { TWOFIELD_DISABLE = 0, TWOFIELD_ENABLE = 1 } ZV_TWOFIELD_MODE;

/** Motion-JPEG quality. The card has one for all channels: the last Motion-JPEG channel sets it. */
typedef enum ZV_JPEG_QUALITY {
  JPEG_QP_ZV_LOW = 0,
  JPEG_QP_ZV_MEDIUM = 1,
  JPEG_QP_ZV_HIGH = 2, /**< the same as medium */
  /** The quality of the nearest Motion JPEG channel with a lower number that has one; medium if none has. */
  JPEG_QP_ZV_UNSUPPORT = 3
} ZV_JPEG_QUALITY;

/** Frame rate of a channel, in frames a second. NTSC and PAL names share the same numbers. */
typedef enum ZV_INTERVAL_VALUE {
  INTERVAL_ZV_30FPS_NTSC = 0,
  INTERVAL_ZV_27FPS_NTSC = 1,
  INTERVAL_ZV_25FPS_NTSC = 2,
  INTERVAL_ZV_24FPS_NTSC = 3,
  INTERVAL_ZV_22DOT5FPS_NTSC = 4,
  INTERVAL_ZV_20FPS_NTSC = 5,
  INTERVAL_ZV_15FPS_NTSC = 6,
  INTERVAL_ZV_10FPS_NTSC = 7,
  INTERVAL_ZV_7DOT5FPS_NTSC = 8,
  INTERVAL_ZV_6FPS_NTSC = 9,
  INTERVAL_ZV_5FPS_NTSC = 10,
  INTERVAL_ZV_3DOT75FPS_NTSC = 11,
  INTERVAL_ZV_3FPS_NTSC = 12,
  INTERVAL_ZV_2FPS_NTSC = 13,
  INTERVAL_ZV_1DOT2FPS_NTSC = 14,
  INTERVAL_ZV_1FPS_NTSC = 15,
  INTERVAL_ZV_25FPS_PAL = 0,
  INTERVAL_ZV_22DOT5FPS_PAL = 1,
  INTERVAL_ZV_20DOT83FPS_PAL = 2,
  INTERVAL_ZV_20FPS_PAL = 3,
  INTERVAL_ZV_18DOT75FPS_PAL = 4,
  INTERVAL_ZV_16DOT66FPS_PAL = 5,
  INTERVAL_ZV_12DOT5FPS_PAL = 6,
  INTERVAL_ZV_8DOT33FPS_PAL = 7,
  INTERVAL_ZV_6DOT25FPS_PAL = 8,
  INTERVAL_ZV_5FPS_PAL = 9,
  INTERVAL_ZV_4DOT16FPS_PAL = 10,
  INTERVAL_ZV_3DOT12FPS_PAL = 11,
  INTERVAL_ZV_2DOT5FPS_PAL = 12,
  INTERVAL_ZV_1DOT66FPS_PAL = 13,
  INTERVAL_ZV_1FPS_PAL = 14,
  INTERVAL_ZV_INVALID = 16
} ZV_INTERVAL_VALUE;

/** A rectangle in pixels and lines of the input picture; the end edges are exclusive. */
typedef struct ZV_RECT {
  u32 x_start; /**< left edge, 0 to the input width */
  u32 y_start; /**< top edge, 0 to the lines of the standard */
  u32 x_end;   /**< right edge, not below x_start */
  u32 y_end;   /**< bottom edge, not below y_start */
} ZV_RECT;

/** Picture properties of a channel, in user units. */
typedef struct ZV_VIDEO_PROPERTY {
  i32 hue;        /**< degrees, -180 to 180, even; 0 is neutral */
  i32 saturation; /**< percent, 0 to 200; 100 is neutral */
  i32 contrast;   /**< percent, 0 to 200; 100 is neutral */
  i32 brightness; /**< percent, -25 to 25; 0 is neutral */
} ZV_VIDEO_PROPERTY;

/** Encoder settings of a channel. */
typedef struct ZV_VIDEO_CONFIG {
  ZV_VIDEO_CODEC mjpeg;       /**< codec of the channel */
  ZV_SCALE_VALUE scale;       /**< picture size; SCALE_ZV_NO_ENCODE: the channel is not encoded */
  u32 gop;                    /**< MPEG-4: frames from one intra frame to the next, at least 1 */
  u32 qp;                     /**< MPEG-4: quantiser, 1 to 31 */
  ZV_INTERVAL_VALUE interval; /**< frame rate */
  ZV_TWOFIELD_MODE twofield;  /**< whether to encode both fields at half height; needs interval 0 */
  ZV_JPEG_QUALITY jpeg_qp;    /**< Motion-JPEG quality */
  u32 enable;                 /**< 1 while the channel is enabled for encoding */
  i32 CBRValue;               /**< target of the constant bit rate, bits a second */
  u32 CBREnable;              /**< non-zero: encode at CBRValue; 0: encode with qp */
  u32 QPMinMaxEnable;         /**< non-zero: keep the quantiser between QPMin and QPMax */
  u32 QPMax;                  /**< upper bound; must be above QPMin and at most 29, else no range is sent */
  u32 QPMin;                  /**< lower bound; must be at least 1, else no range is sent */
} ZV_VIDEO_CONFIG;

/** Flag of a ZV_DISPLAY_WINDOW: the window is part of the preview. */
#define ZV_WINDOW_ENABLED 0x1u
/** Flag of a ZV_DISPLAY_WINDOW: the window is the picture-in-picture. */
#define ZV_WINDOW_PIP 0x2u

/** One window of the preview picture. The end edges are exclusive. */
typedef struct ZV_DISPLAY_WINDOW {
  u32 index;   /**< window number 0-15 */
  u32 channel; /**< input channel shown, 0-15 */
  u32 scale;   /**< scale code; 0 when the window is not shown */
  u32 x_start; /**< left edge, pixels */
  u32 y_start; /**< top edge, lines */
  u32 x_end;   /**< right edge, pixels */
  u32 y_end;   /**< bottom edge, lines */
  u32 flags;   /**< ZV_WINDOW_ENABLED, ZV_WINDOW_PIP */
} ZV_DISPLAY_WINDOW;

/** State of the preview picture. Programs may read it; only the zv_display functions may change it. */
typedef struct ZV_DISPLAY {
  i32 fd;                       /**< descriptor of the display device */
  u32 width;                    /**< display width, pixels; 0 until the display is opened */
  u32 height;                   /**< display height, lines; 0 until the display is opened */
  u32 mode;                     /**< stored layout, a ZV_VIDEO_MODE */
  u32 zoom;                     /**< zoom level; 0 is off */
  ZV_DISPLAY_WINDOW window[16]; /**< the windows */
  ZV_DISPLAY_WINDOW *pip;       /**< the picture-in-picture window; null when there is none */
} ZV_DISPLAY;

#ifdef __cplusplus
}
#endif

#endif
