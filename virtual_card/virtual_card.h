/**
 * @file virtual_card.h
 * Control of the virtual card: what a hand at the machine could do to a real one, for tests and
 * benchmarks. Programs that only use the card never need this header.
 *
 * All functions may be called from any thread. The card of this process is made at the first use of
 * a device node or of this interface, with the options of the environment variable ZARVO_VIRTUAL_CARD.
 * Channels count from 0 to 15, audio inputs and decoder chips from 0 to 3, one less than the numbers that
 * people read, in the environment variable too. One that does not exist throws std::out_of_range.
 */
#ifndef VIRTUAL_CARD_H
#define VIRTUAL_CARD_H

#include <cerrno>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

// The library exports these functions and nothing else of its own.
#pragma GCC visibility push(default)

namespace virtual_card {

// --- Power -------------------------------------------------------------------------------------

/// The card as built: power-up registers, all cameras plugged and moving, real-time clock, empty
/// queues, no faults, no log, counters zero, no options. Only while no device node is open, else it
/// says so on standard error and does nothing.
void reset();

/// Number of descriptors on device nodes, and of mappings of their regions, now in use.
int open_descriptors();
int open_mappings();

// --- Clock -------------------------------------------------------------------------------------

enum class ClockMode {
  real_time,  ///< card time runs with the monotonic clock
  fast,       ///< card time runs `speed` times as fast
  manual      ///< card time stands still until advance()
};

/// Card time begins at 0 again. Only while no device node is open, as reset(). `speed` counts with
/// ClockMode::fast only.
void set_clock(ClockMode mode, double speed = 1.0);

/// Manual clock: moves card time on, and returns when everything that became due has been drawn,
/// encoded and queued. What is due at the very end of the time is not reached yet. Nothing happens
/// with the other clocks.
void advance(std::chrono::microseconds time);
/// Manual clock: advance() by whole frames of the current standard, without rounding drift.
void advance_frames(int frames);

// --- Cameras and audio inputs ------------------------------------------------------------------

enum class Scene {
  moving,  ///< bars, a moving object, the clock
  still,   ///< bars and the channel number only: nothing moves
  black    ///< a covered lens
};

/// The signal is lost: a blue picture, no motion, the decoder's video bit clear.
void unplug_camera(unsigned channel);
void plug_camera(unsigned channel);
/// What is in front of a camera that has no film.
void set_scene(unsigned channel, Scene scene);
/// Puts a video file in front of the camera; an empty path takes it away. False, with the reason in `error`,
/// when it cannot be read as video.
bool show_film(unsigned channel, const std::string &path, std::string *error = nullptr);
/// No sound arrives: the decoder's audio bit is clear.
void silence_input(unsigned input);
void sound_input(unsigned input);

// --- Ready-made data ---------------------------------------------------------------------------

/// What the next read of a stream delivers: `area` is copied to the start of the stream's area as it
/// is, and the read returns `result`. Nothing is checked, so that a card that lies can be played.
/// For Motion JPEG the area starts at its descriptor, area offset 1024.
struct ReadyFrame {
  std::vector<std::uint8_t> area;
  long result;
};

/// An MPEG-4 frame with a right descriptor. `type` 0 is an intra frame; the time is card time.
ReadyFrame mpeg4_frame(unsigned channel, unsigned type, const std::vector<std::uint8_t> &bitstream,
                       std::chrono::microseconds time = std::chrono::microseconds{0});
/// A Motion-JPEG frame with a right descriptor around scan data (which ends in its own EOI).
ReadyFrame mjpeg_frame(unsigned channel, unsigned width, unsigned height,
                       const std::vector<std::uint8_t> &scan);

/// Frames wait in the stream's queue, in turn with the card's own; a full queue loses them.
void queue_mpeg4(ReadyFrame frame);
void queue_mjpeg(ReadyFrame frame);
/// Four blocks of 48 bytes, or whatever is given; 192 bytes at most reach the host.
void queue_audio(ReadyFrame blocks);
/// The preview read stores `index` and returns `result`, once.
void queue_preview(std::uint32_t index, long result);

/// An endless supply of ready-made frames instead of the card's own encoders: the lists are
/// delivered round and round from ENC_IOC_START on, `limit` reads of each stream at most.
struct Supply {
  std::vector<ReadyFrame> mpeg4;
  std::vector<ReadyFrame> mjpeg;
  std::vector<ReadyFrame> audio;
  double video_rate = 0;  ///< frames of each stream a second of card time; 0: as fast as they are read
  double audio_rate = 0;  ///< blocks of four a second of card time; 0: as fast as they are read
  std::uint64_t limit = ~std::uint64_t{0};
};
void set_supply(Supply supply);
/// Back to the card's own encoders.
void clear_supply();

/// Reads of an empty stream return at once, as another driver's might, instead of waiting up to 10 ms.
void set_nowait(bool on);

// --- Registers and replies ---------------------------------------------------------------------

/// What the chips hold, as the driver's register commands would read and write it; what hangs on a register
/// changes with it.
std::uint32_t codec_register(std::uint32_t address);
void set_codec_register(std::uint32_t address, std::uint32_t value);
std::uint32_t video_input_register(std::uint32_t address);
void set_video_input_register(std::uint32_t address, std::uint32_t value);
std::uint8_t decoder_register(unsigned chip, unsigned address);
void set_decoder_register(unsigned chip, unsigned address, std::uint8_t value);

/// The board controller answers the next commands of this code with these replies, one each, then for
/// itself again. A command is carried out only when its reply is the one that confirms it.
void script_board_replies(std::uint32_t command, std::vector<std::uint32_t> replies);
/// The board revision that command 0x3A answers: 0x00, 0xBB, 0xCC or 0xDD.
void set_board_version(std::uint32_t reply);
/// DISP_IOC_GET_MOTION answers these bits instead of what the card has detected, until reset.
void script_motion(std::uint32_t bits);
/// What VIN_IOC_GET_MOTION_LEVELS answers for a channel, and its threshold until a map is set: 0 to 0xFFFF,
/// which never moves.
void set_motion_level(unsigned channel, std::uint16_t level);

// --- Log ---------------------------------------------------------------------------------------

enum class Device { encoder, display, audio, video_input, none };
enum class Operation { open, close, ioctl, read, mmap, munmap };

struct Call {
  Operation operation;
  Device device;
  std::uint32_t code = 0;  ///< ioctl: command code
  std::vector<std::uint8_t>
      argument{};            ///< ioctl: the record as it came in, the motion map's thresholds behind it
  std::uintptr_t value = 0;  ///< ioctl: the third argument itself; read: the buffer address
  std::size_t size = 0;      ///< read: count; mmap and munmap: length
  int protection = 0;        ///< mmap
  int flags = 0;             ///< open and mmap
  long result = 0;           ///< as the host got it; 0 for a mapping
};

/// Starts the log afresh, or ends it. It is off at first.
void record_log(bool on);
/// What was done to the device nodes since record_log(true), in order.
std::vector<Call> log();

// --- Faults ------------------------------------------------------------------------------------

/// Makes an operation on the device nodes fail: the `countdown`-th matching one from now (1 is the
/// next), once or from then on for good. `device` none matches every node, `code` 0 every command.
/// The operation then does nothing, but for close, which reports the error and closes the descriptor
/// all the same, as Linux does.
struct Fault {
  Operation operation;
  int countdown = 1;
  bool for_good = false;
  int error = EIO;
  Device device = Device::none;
  std::uint32_t code = 0;
};
/// There is one injector; a new fault replaces the old one and sets the hits to 0.
void inject(Fault fault);
void clear_fault();
/// How often the fault has struck.
int fault_hits();

// --- Counters ----------------------------------------------------------------------------------

struct StreamCounters {
  std::uint64_t made = 0;       ///< frames encoded, or supplied and come due
  std::uint64_t delivered = 0;  ///< frames handed to a read
  std::uint64_t lost = 0;       ///< frames dropped since the host was too slow
};

struct Counters {
  StreamCounters mpeg4;
  StreamCounters mjpeg;
  StreamCounters audio;
  std::uint64_t previews = 0;         ///< preview pictures composed
  std::uint64_t watchdog_kicks = 0;   ///< times the watchdog was started or fed
  std::uint64_t watchdog_resets = 0;  ///< times it would have reset the machine
  bool watchdog_running = false;
};
Counters counters();

}  // namespace virtual_card

#pragma GCC visibility pop

#endif
