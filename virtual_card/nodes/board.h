/**
 * @file board.h
 * The state that the card's device nodes share: settings, chips, streams and the engine.
 */
#ifndef VIRTUAL_CARD_BOARD_H
#define VIRTUAL_CARD_BOARD_H

#include <atomic>
#include <deque>
#include <optional>

#include "board_controller.h"
#include "call_faults.h"
#include "call_log.h"
#include "clock.h"
#include "picture/engine.h"
#include "region.h"
#include "register_file.h"
#include "script.h"
#include "stream.h"

namespace virtual_card {

/// The settings that commands write and read. The constructor sets the power-up state.
struct BoardSettings {
  CardState state;
  Layout batch;           ///< the layout that is being changed while `batching`
  bool batching = false;  ///< between DISP_IOC_BEGIN_UPDATE and DISP_IOC_END_UPDATE
  RegisterFile codec = codec_at_power_up();
  RegisterFile video_input = video_input_at_power_up();
  DecoderChips decoders;
  BoardController controller;
  std::array<u16, kChannels> motion_level{};
  std::optional<u32> scripted_motion;
  u32 selected_buffer = 0;
  u32 session = 0;                                     ///< number of starts and stops of encoding so far
  nanoseconds encoding_since{0};                       ///< card time of ENC_IOC_START
  nanoseconds supplied_since{0};                       ///< card time of the last set_supply()
  std::deque<std::pair<u32, long>> scripted_previews;  ///< index and result of the next preview reads
  BoardSettings();
};

/// The use of the four preview buffers.
struct PreviewBuffers {
  std::optional<u32> newest;  ///< buffer of the last picture composed
  long size = 0;              ///< bytes of that picture
  std::optional<u32> handed;  ///< buffer that the host read last and may still be using
  std::uint64_t composed = 0;

  /// Returns the buffer for the next picture: the next in turn that is not `handed`.
  u32 next() const;
};

struct Board {
  Board();

  /// Restores the power-up state. Call it only while no node is open.
  void reset();
  /// Sets the common standard of encoder, display and video input. The caller holds `mutex`.
  long set_standard(u32 standard);
  /// Write a register of a chip and update the settings that depend on it. The caller holds `mutex`.
  void write_codec(u32 address, u32 value);
  void write_video_input(u32 address, u32 value);
  void write_decoder(unsigned chip, unsigned address, u8 value);
  /// Stops encoding and drops the queued frames. The caller holds `mutex`.
  void stop_encoding();
  /// Drops the queued frames if `session` is no longer the current session: encoding may be stopped while a
  /// field is being encoded, and the frames of that field must not start the next recording.
  void drop_frames_of_other_session(u32 session);
  /// Stops encoding and preview: the last descriptor of all nodes is closed.
  void last_close();
  /// Ends the supply of ready-made frames: the card's encoders deliver again.
  void clear_supply();
  /// Returns how long a read may wait for a frame.
  microseconds read_wait() const;

  /// Applies a line of items. Returns an empty text, or what is wrong with it; then nothing has changed.
  std::string apply(std::string_view line, PowerUp *power_up = nullptr);
  /// Brings the conditions up to date when the time line has changed them.
  void refresh(nanoseconds now);
  /// Returns the card time of the next change by the time line; nanoseconds::max() when there is none.
  nanoseconds next_change() const { return nanoseconds{next_change_.load(std::memory_order_relaxed)}; }
  /// Updates which cameras have a signal at a field. The caller holds `mutex`.
  void set_signals(std::int64_t field);
  /// Returns what a read of the register gives. The caller holds `mutex`.
  u32 read_register(const RegisterFile &registers, u32 address);

  std::mutex mutex;  ///< guards `settings`, `conditions`, `preview` and `preview_faults`
  BoardSettings settings;
  Conditions conditions;
  PreviewBuffers preview;
  StreamFaults preview_faults{StreamKind::preview};
  std::atomic<bool> encoding{false};  ///< copy of settings.state.encoding, for reads without the mutex
  std::atomic<bool> supplied{false};  ///< ready-made frames replace the encoders
  // Copies of members of `conditions`, for calls without the mutex.
  std::atomic<bool> nowait{false};
  std::atomic<bool> absent{false};
  std::atomic<bool> vanished{false};

  std::string power_up_error;  ///< what is wrong with the options; opening a node fails then
  Clock clock;
  CallFaults call_faults;
  CallLog log;
  Stream mpeg4;
  Stream mjpeg;
  Stream audio;
  Region stream_region{"zarvo_enc0", driver::kStreamRegionSize};
  Region preview_region{"zarvo_disp0", driver::kPreviewBuffers *driver::kPreviewBufferSize};
  Region audio_region{"zarvo_g723_0", 0};
  Region video_input_region{"zarvo_vin0", 0};
  Engine engine;

 private:
  /// Computes the conditions at a time and carries them out. The caller holds script_mutex_.
  void change_conditions(nanoseconds now);
  void set_conditions(const Conditions &next);

  std::mutex script_mutex_;  // guards script_; taken before `mutex`
  Script script_;
  std::atomic<std::int64_t> next_change_{nanoseconds::max().count()};
  std::minstd_rand random_;  // guarded by `mutex`
};

}  // namespace virtual_card

#endif
