/**
 * @file virtual_card.h
 * Control of the virtual card for tests and benchmarks: unplug cameras, move the clock, break the card,
 * read counters. Programs that only use the card do not need this header.
 *
 * All functions may be called from any thread. The first use of a device node or of this interface creates
 * the card of this process, with the items of the environment variable ZARVO_VIRTUAL_CARD. Channels count
 * from 0 to 15, audio inputs and decoder chips from 0 to 3; items, here and in the environment variable,
 * count from 1. A channel, input or chip that does not exist throws std::out_of_range; ready-made frames may
 * name any channel.
 */
#ifndef VIRTUAL_CARD_H
#define VIRTUAL_CARD_H

#include <cerrno>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

// The library exports these functions and the libc names, nothing else.
#pragma GCC visibility push(default)

namespace virtual_card {

// --- Power -------------------------------------------------------------------------------------

/// Puts the card into its power-up state: initial registers, all cameras plugged and moving, real-time clock,
/// empty queues, no faults, no log of calls, counters zero, no items. A log file and a control socket that
/// the items `log` and `control` have opened stay in use. While a device node is open, prints a line on
/// standard error and does nothing.
void reset();

/// Return the number of descriptors of device nodes and the number of mappings of their regions in use.
int open_descriptors();
int open_mappings();

// --- Clock -------------------------------------------------------------------------------------

enum class ClockMode {
  real_time,  ///< card time runs with the monotonic clock
  fast,       ///< card time runs `speed` times as fast
  manual      ///< card time stands still until advance()
};

/// Sets the clock mode and starts card time at 0. Only ClockMode::fast uses `speed`. While a device node is
/// open, or for a `speed` that is not above 0, prints a line on standard error and does nothing.
void set_clock(ClockMode mode, double speed = 1.0);

/// Manual clock: advances card time and returns when everything that became due has been drawn, encoded
/// and queued. What is due exactly at the end of the step does not run yet. With the other clocks it does
/// nothing.
void advance(std::chrono::microseconds time);
/// Manual clock: advances by whole frames of the current standard; rounding errors do not add up.
void advance_frames(int frames);

// --- Items -------------------------------------------------------------------------------------

/// Applies a line of items, the language of ZARVO_VIRTUAL_CARD and of zarvo_card, e.g.
/// "lost=3; @5-8 stall=mpeg4". Times count from now in card time. A line replaces what earlier lines said of
/// the same names: "lost=" only undoes it, and "reset" undoes all items but those of power-up. Throws
/// std::invalid_argument, which says what is possible, for a wrong line; then nothing has changed.
void apply(const std::string &line);

/// A row of the table of items, for people.
struct ItemText {
  std::string usage;   ///< e.g. "lost=CHANNELS"
  std::string values;  ///< the possible values
  std::string effect;  ///< what the host sees
};
std::vector<ItemText> items();

// --- Ready-made data ---------------------------------------------------------------------------

/// Data for one read of a stream: the read copies `area` unchanged to the start of the stream's area and
/// returns `result`. Neither is checked, so that a test can play a faulty card. The Motion-JPEG area starts
/// at its descriptor, offset 1024.
struct ReadyFrame {
  std::vector<std::uint8_t> area;
  long result;
};

/// Returns an MPEG-4 frame with a correct descriptor. `type` 0 is an intra frame; `time` is the capture time
/// in the descriptor.
ReadyFrame mpeg4_frame(unsigned channel, unsigned type, const std::vector<std::uint8_t> &bitstream,
                       std::chrono::microseconds time = std::chrono::microseconds{0});
/// Returns a Motion-JPEG frame with a correct descriptor. `scan` is the scan data with its EOI marker.
ReadyFrame mjpeg_frame(unsigned channel, unsigned width, unsigned height,
                       const std::vector<std::uint8_t> &scan);

/// Append a frame to the stream's queue, behind the frames that wait there. A full queue drops it.
void queue_mpeg4(ReadyFrame frame);
void queue_mjpeg(ReadyFrame frame);
/// Appends audio data, normally four blocks of 48 bytes. The read delivers at most 192 bytes.
void queue_audio(ReadyFrame blocks);
/// The next preview read stores `index` and returns `result`. Call it n times to set the next n reads.
void queue_preview(std::uint32_t index, long result);

/// Ready-made frames that replace the card's encoders. From ENC_IOC_START each list is delivered again and
/// again, in at most `limit` reads.
struct Supply {
  std::vector<ReadyFrame> mpeg4;
  std::vector<ReadyFrame> mjpeg;
  std::vector<ReadyFrame> audio;
  double video_rate = 0;  ///< frames a second of card time, each stream; 0: one for each read
  double audio_rate = 0;  ///< reads of four blocks a second of card time; 0: one for each read
  std::uint64_t limit = ~std::uint64_t{0};
};
void set_supply(Supply supply);
/// Ends the supply: the card's encoders deliver again.
void clear_supply();

// --- Registers and replies ---------------------------------------------------------------------

/// Read and write registers of the chips. A write has the same effects as the driver's register command.
std::uint32_t codec_register(std::uint32_t address);
void set_codec_register(std::uint32_t address, std::uint32_t value);
std::uint32_t video_input_register(std::uint32_t address);
void set_video_input_register(std::uint32_t address, std::uint32_t value);
std::uint8_t decoder_register(unsigned chip, unsigned address);
void set_decoder_register(unsigned chip, unsigned address, std::uint8_t value);

/// Sets the board controller's replies to the next commands with this code, one reply for each command.
/// After them it replies normally. If a scripted reply is not the confirming one, the command is not carried
/// out.
void script_board_replies(std::uint32_t command, std::vector<std::uint32_t> replies);
/// Makes DISP_IOC_GET_MOTION return these bits instead of the detected motion, until reset().
void script_motion(std::uint32_t bits);
/// Sets the motion threshold of all blocks of a channel, which VIN_IOC_GET_MOTION_LEVELS then returns. 0xFFFF
/// never reports motion.
void set_motion_level(unsigned channel, std::uint16_t level);

// --- Log ---------------------------------------------------------------------------------------

enum class Device { encoder, display, audio, video_input, none };
enum class Operation { open, close, ioctl, read, mmap, munmap };

struct Call {
  Operation operation;
  Device device;
  std::uint32_t code = 0;  ///< ioctl: command code
  std::vector<std::uint8_t>
      argument{};            ///< ioctl: the record before the command; a motion map's thresholds follow it
  std::uintptr_t value = 0;  ///< ioctl: third argument; read: buffer address
  std::size_t size = 0;      ///< read: count; mmap and munmap: length
  int protection = 0;        ///< mmap
  int flags = 0;             ///< open and mmap
  long result = 0;           ///< result that the host received; 0 for a mapping
  int error = 0;             ///< errno of a call that failed
};

/// Clears the log and starts it, or stops it. The log is off at first.
void record_log(bool on);
/// Returns the calls on device nodes since record_log(true), in order.
std::vector<Call> log();

// --- Counters ----------------------------------------------------------------------------------

struct StreamCounters {
  std::uint64_t made = 0;       ///< frames encoded, or supplied and due; lost ones too
  std::uint64_t delivered = 0;  ///< frames that a read returned
  std::uint64_t lost = 0;       ///< frames dropped: queue full, or the card could not make them
};

struct Counters {
  StreamCounters mpeg4;
  StreamCounters mjpeg;
  StreamCounters audio;
  std::uint64_t previews = 0;         ///< preview pictures composed
  std::uint64_t failed_calls = 0;     ///< calls that the item "fail" has made fail
  std::uint64_t watchdog_kicks = 0;   ///< times the watchdog was started or fed
  std::uint64_t watchdog_resets = 0;  ///< times the watchdog would have reset the machine
  bool watchdog_running = false;
};
Counters counters();

}  // namespace virtual_card

#pragma GCC visibility pop

#endif
