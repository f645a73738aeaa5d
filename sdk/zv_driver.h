/**
 * @file zv_driver.h
 * The interface to the card's kernel driver: node paths, command codes, records, registers and memory
 * regions. No other file repeats a code, a size or an offset.
 *
 * The command codes have the Linux _IOC layout. They are written as numbers because the driver compares the
 * whole number. All words are little-endian; every record is passed by address.
 */
#ifndef ZV_DRIVER_H
#define ZV_DRIVER_H

#include <cstddef>

#include "zv_type.h"

namespace zarvo::driver {

// Device nodes.
inline constexpr char kEncoderNode[] = "/dev/zarvo_enc0";
inline constexpr char kDisplayNode[] = "/dev/zarvo_disp0";
inline constexpr char kAudioNode[] = "/dev/zarvo_g723_0";
inline constexpr char kVideoInputNode[] = "/dev/zarvo_vin0";
inline constexpr char kDecoderNode[] = "/dev/zarvo_dec0";
inline constexpr char kNodePrefix[] = "/dev/zarvo_";  // common prefix of all node paths

// Commands of the encoder device.
inline constexpr u32 ENC_IOC_SET_SCALE = 0x40086500;           // ChannelValue
inline constexpr u32 ENC_IOC_SET_INTERVAL = 0x400C6501;        // Interval
inline constexpr u32 ENC_IOC_SET_GOP = 0x40086502;             // ChannelValue
inline constexpr u32 ENC_IOC_SET_QP = 0x40086503;              // ChannelValue
inline constexpr u32 ENC_IOC_GET_SCALE = 0xC0086504;           // ChannelValue
inline constexpr u32 ENC_IOC_GET_INTERVAL = 0xC00C6505;        // Interval
inline constexpr u32 ENC_IOC_GET_GOP = 0xC0086506;             // ChannelValue
inline constexpr u32 ENC_IOC_GET_QP = 0xC0086507;              // ChannelValue
inline constexpr u32 ENC_IOC_MPEG4_DONE = 0x00006509;          // no argument
inline constexpr u32 ENC_IOC_CHANNEL_NUMBER_ON = 0xC004650B;   // u32 channel
inline constexpr u32 ENC_IOC_CHANNEL_NUMBER_OFF = 0xC004650C;  // u32 channel
inline constexpr u32 ENC_IOC_WRITE_REG = 0xC008650E;           // Register
inline constexpr u32 ENC_IOC_MPEG4_REQUEST = 0x0000650F;       // no argument
inline constexpr u32 ENC_IOC_STOP = 0x00006510;                // the number 0 as third argument
inline constexpr u32 ENC_IOC_SET_STANDARD = 0xC0046511;        // u32 standard
inline constexpr u32 ENC_IOC_START = 0x00006512;               // no argument
inline constexpr u32 ENC_IOC_SET_CBR = 0xC00C6513;             // Cbr
inline constexpr u32 ENC_IOC_SET_QP_RANGE = 0xC0106514;        // QpRange

// Commands of the display device.
inline constexpr u32 DISP_IOC_BEGIN_UPDATE = 0x00006400;      // no argument
inline constexpr u32 DISP_IOC_END_UPDATE = 0x00006401;        // no argument
inline constexpr u32 DISP_IOC_SET_WINDOW = 0x40206402;        // ZV_DISPLAY_WINDOW
inline constexpr u32 DISP_IOC_SET_ZOOM = 0x400C6403;          // Zoom
inline constexpr u32 DISP_IOC_SET_SOURCE_CFG = 0x40046406;    // u32: bits 28-31 source group, bits 0-27 value
inline constexpr u32 DISP_IOC_SET_GRID = 0x40306407;          // Grid
inline constexpr u32 DISP_IOC_SET_RECT = 0x401C6408;          // FrameRect
inline constexpr u32 DISP_IOC_MOTION_TRACE_ON = 0x00006409;   // no argument
inline constexpr u32 DISP_IOC_MOTION_TRACE_OFF = 0x0000640A;  // no argument
inline constexpr u32 DISP_IOC_GET_WIDTH = 0x8004640B;         // u32 pixels, output
inline constexpr u32 DISP_IOC_GET_HEIGHT = 0x8004640C;        // u32 lines of one field, output
inline constexpr u32 DISP_IOC_SET_STANDARD = 0xC004640D;      // u32 standard
inline constexpr u32 DISP_IOC_READ_REG = 0xC008640E;          // Register, value output
inline constexpr u32 DISP_IOC_WRITE_REG = 0xC008640F;         // Register
inline constexpr u32 DISP_IOC_PREVIEW_ON = 0x00006410;        // no argument
inline constexpr u32 DISP_IOC_PREVIEW_OFF = 0x00006411;       // no argument
inline constexpr u32 DISP_IOC_GET_MOTION = 0x80046412;        // u32 channel bits, output
inline constexpr u32 DISP_IOC_SELECT_BUFFER = 0xC0046413;     // u32 preview buffer 0-3

// Commands of the video-input device.
inline constexpr u32 VIN_IOC_SET_MASK = 0x40147601;           // Mask
inline constexpr u32 VIN_IOC_SET_MOTION_MAP = 0x40187602;     // MotionMap
inline constexpr u32 VIN_IOC_SET_STANDARD = 0xC0047604;       // u32 standard
inline constexpr u32 VIN_IOC_READ_REG = 0xC0087605;           // Register, value output
inline constexpr u32 VIN_IOC_WRITE_REG = 0xC0087606;          // Register
inline constexpr u32 VIN_IOC_READ_TW2815 = 0xC0037607;        // DecoderRegister, value output
inline constexpr u32 VIN_IOC_WRITE_TW2815 = 0xC0037608;       // DecoderRegister
inline constexpr u32 VIN_IOC_SET_WIDTH = 0xC0047609;          // u32 pixels, 720 or 704
inline constexpr u32 VIN_IOC_BOARD_CMD = 0xC008760A;          // BoardCommand, reply output
inline constexpr u32 VIN_IOC_GET_MOTION_LEVELS = 0xC002760B;  // MotionLevels: 32 bytes, but the code says 2

/// A value that belongs to one channel.
struct ChannelValue {
  u32 channel;
  u32 value;
};

/// Frame interval of one channel.
struct Interval {
  u32 channel;
  u32 code;  ///< bits 0-7 frame-skip count, bit 9 drop mode
  u32 drop;  ///< drop mode again, 0 or 1; unused when reading
};
inline constexpr u32 kIntervalSkipMask = 0xFF;
inline constexpr u32 kIntervalDropShift = 9;

struct Cbr {
  u32 channel;
  u32 value;
  u32 enable;
};

struct QpRange {
  u32 channel;
  u32 max;
  u32 min;
  u32 enable;
};

/// A codec-chip or video-input register.
struct Register {
  u32 address;
  u32 value;
};

struct Zoom {
  u32 level;
  u32 x;
  u32 y;
};

struct Grid {
  u32 column[5];
  u32 row[5];
  u32 cells;  ///< bit row * 4 + column for each cell with an ordinary window
  u32 reserved;
};

struct FrameRect {
  u32 number;  ///< kScreenFrame or kPipFrame
  u32 x_start;
  u32 y_start;
  u32 x_end;
  u32 y_end;
  u32 enable;
  u32 reserved;
};
inline constexpr u32 kScreenFrame = 0;
inline constexpr u32 kPipFrame = 1;

// Source words: the bits from kSourceGroupShift up hold the source group.
inline constexpr u32 kSourceGroupShift = 28;
inline constexpr u32 kSourceGroups = 4;

/// A privacy mask. Unlike in ZV_RECT, both x edges come before both y edges.
struct Mask {
  u32 channel;
  u32 x_start;
  u32 x_end;
  u32 y_start;
  u32 y_end;
};
inline constexpr u32 kMaskUnit = 8;  ///< pixels or lines in one unit of a mask register

/// Packs a mask in units into a mask register: one byte for each edge, x_start in the highest byte.
constexpr u32 packed_mask(const Mask &units) {
  return units.x_start << 24 | units.x_end << 16 | units.y_start << 8 | units.y_end;
}

/// Unpacks a mask register into a mask in pixels and lines.
constexpr Mask unpacked_mask(u32 channel, u32 packed) {
  return {channel, (packed >> 24) * kMaskUnit, (packed >> 16 & 0xFF) * kMaskUnit,
          (packed >> 8 & 0xFF) * kMaskUnit, (packed & 0xFF) * kMaskUnit};
}

/// Thresholds of a rectangle of blocks. The size depends on the caller's pointer size: 32 bytes on a 64-bit
/// machine, although the size field of the command code is always 24.
struct MotionMap {
  u32 channel;
  u32 column;
  u32 row;
  u32 columns;
  u32 rows;
  const u16 *thresholds;  ///< columns x rows values, row by row
};
inline constexpr u32 kMotionBlock = 16;     ///< width and height of a motion block, pixels and lines
inline constexpr u32 kMotionMapSide = 64;   ///< columns and rows of a whole map, in blocks
inline constexpr u16 kNeverMoves = 0xFFFF;  ///< the threshold of a block that never reports motion

/// A TW2815 register.
struct DecoderRegister {
  u8 chip;
  u8 address;
  u8 value;
};

struct BoardCommand {
  u32 command;
  u32 reply;
};

struct MotionLevels {
  u16 level[16];
};

static_assert(sizeof(ChannelValue) == 8 && sizeof(Register) == 8 && sizeof(BoardCommand) == 8);
static_assert(sizeof(Interval) == 12 && sizeof(Cbr) == 12 && sizeof(Zoom) == 12);
static_assert(sizeof(QpRange) == 16 && sizeof(Mask) == 20 && sizeof(FrameRect) == 28);
static_assert(sizeof(Grid) == 48 && offsetof(Grid, row) == 20 && offsetof(Grid, cells) == 40);
static_assert(sizeof(ZV_DISPLAY_WINDOW) == 32 && offsetof(ZV_DISPLAY_WINDOW, flags) == 28);
static_assert(sizeof(DecoderRegister) == 3 && sizeof(MotionLevels) == 32);
static_assert(offsetof(Mask, x_end) == 8 && offsetof(Mask, y_start) == 12);
static_assert(offsetof(MotionMap, rows) == 16 &&
              offsetof(MotionMap, thresholds) == (sizeof(void *) == 8 ? 24 : 20));

// Scale codes of ENC_IOC_SET_SCALE; only D1 differs from ZV_SCALE_VALUE.
inline constexpr u32 kScaleCodeD1 = 9;

// Stream region, mapped from the encoder device at offset 0.
inline constexpr std::size_t kStreamRegionSize = 0x200000;
inline constexpr std::size_t kMjpegAreaOffset = 0x100000;
inline constexpr std::size_t kMpeg4AreaSize = kMjpegAreaOffset;
inline constexpr std::size_t kMjpegAreaSize = kStreamRegionSize - kMjpegAreaOffset;

// MPEG-4 area: descriptor, then the bitstream.
inline constexpr std::size_t kMpeg4DescriptorSize = 64;
inline constexpr std::size_t kMpeg4ReadSize = 0x100000;
/// The first word of the descriptor.
struct Mpeg4Head {
  u32 channel;
  u32 type;    ///< 0 intra
  u32 length;  ///< bytes of the bitstream
};
inline constexpr u32 kMpeg4LengthMask = 0xFFFFF;
/// Packs the first word of a descriptor; cuts bits off that do not fit their field.
constexpr u32 packed_head(const Mpeg4Head &head) {
  return (head.length & kMpeg4LengthMask) | (head.type & 3) << 22 | (head.channel & 0xF) << 24;
}
constexpr Mpeg4Head unpacked_head(u32 word) {
  return {word >> 24 & 0xF, word >> 22 & 3, word & kMpeg4LengthMask};
}
inline constexpr std::size_t kMpeg4TimeSeconds = 20;       ///< u32 in the descriptor
inline constexpr std::size_t kMpeg4TimeMicroseconds = 24;  ///< u32 in the descriptor

// Motion-JPEG area: 1024 bytes for the SDK's header, the descriptor, then the scan data.
inline constexpr std::size_t kMjpegDescriptorOffset = 1024;
inline constexpr std::size_t kMjpegDescriptorSize = 16;
inline constexpr std::size_t kMjpegDataOffset = kMjpegDescriptorOffset + kMjpegDescriptorSize;
inline constexpr std::size_t kMjpegReadSize = kMjpegAreaSize - kMjpegDescriptorOffset;

struct MjpegDescriptor {
  u32 channel;
  u32 width;
  u32 height;
  u32 reserved;
};
static_assert(sizeof(MjpegDescriptor) == kMjpegDescriptorSize && kMjpegReadSize == 0xFFC00);

// An audio read fills one block for each input; the block of input n is at n * kAudioBlockSize.
inline constexpr std::size_t kAudioBlockSize = 48;
inline constexpr std::size_t kAudioReadCount = 4;

// Preview buffers: UYVY pictures, mapped read-only from the display device.
inline constexpr u32 kPreviewBuffers = 4;
inline constexpr std::size_t kPreviewBufferSize = 0x240000;

// Codec-chip registers.
inline constexpr u32 kRegMotionEnable = 0x260;   ///< bits 16-31: motion detection on channels 0-15
inline constexpr u32 kRegMotionControl = 0x268;  ///< the SDK writes kMotionControlAll
inline constexpr u32 kRegDisplayState = 0x310;   ///< bit 31: the display is running
inline constexpr u32 kRegMjpegQuality = 0x670;   ///< the SDK writes it through the encoder device
inline constexpr u32 kRegWatchdogTimer = 0xBE4;  ///< kWatchdogTimerOn while fed, 0 off
inline constexpr u32 kMjpegCoarse = 0x02020202;  ///< value of kRegMjpegQuality for low quality
inline constexpr u32 kMjpegFine = 0x02000102;    ///< value of kRegMjpegQuality for medium and high quality
inline constexpr u32 kMotionEnableShift = 16;
inline constexpr u32 kMotionEnableMask = 0xFFFFu << kMotionEnableShift;
inline constexpr u32 kMotionControlAll = 0xFFFF;
inline constexpr u32 kDisplayStateBit = 0x80000000;
inline constexpr u32 kWatchdogTimerOn = 0x1FF;  ///< watchdog period, in a unit of the chip

// Video-input registers.
inline constexpr u32 kRegPrivacyMask = 0x140;  ///< + 4 * channel; see packed_mask()
inline constexpr u32 kRegRouting = 0x180;      ///< + 4 * window: bits 28-31 channel shown
inline constexpr u32 kRoutingShift = 28;

// TW2815 registers; channels 4k to 4k + 3 are on chip k.
inline constexpr u32 kDecoderChips = 4;
inline constexpr u32 kChannelsPerChip = 4;
inline constexpr u8 kDecoderProperty = 0x07;  ///< + 16 * (channel mod 4): first of four property registers
inline constexpr u8 kDecoderChannelStride = 0x10;
/// Pairs of register and value that zv_Open() writes to chip 0.
inline constexpr u8 kDecoderSetup[][2] = {{0x72, 0x00}, {0x73, 0x11}, {0x74, 0x11}};
inline constexpr u8 kDecoderStatus = 0x5A;  ///< bits 0-3 video present; chip 0: bits 4-7 audio present

// Board controller.
inline constexpr u32 kBoardWatchdogOn = 0x2B;
inline constexpr u32 kBoardWatchdogOff = 0x2D;
inline constexpr u32 kBoardVersion = 0x3A;
inline constexpr u32 kBoardWatchdogOnReply = 0xA3;
inline constexpr u32 kBoardWatchdogOffReply = 0xA5;
/// Replies by hardware version. The reply 0 also means version 0.
inline constexpr u32 kBoardVersionReplies[] = {0xBB, 0xCC, 0xDD};

}  // namespace zarvo::driver

#endif
