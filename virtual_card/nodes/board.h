/**
 * @file board.h
 * What the device nodes of the card share: the settings, the chips, the streams and the picture side.
 */
#ifndef VIRTUAL_CARD_BOARD_H
#define VIRTUAL_CARD_BOARD_H

#include <atomic>
#include <deque>
#include <optional>

#include "board_controller.h"
#include "call_log.h"
#include "clock.h"
#include "injector.h"
#include "options.h"
#include "picture/engine.h"
#include "region.h"
#include "register_file.h"
#include "stream.h"

namespace virtual_card {

/// What commands set and ask, as it is at power-up.
struct BoardSettings {
  CardState state;
  Layout batch;           ///< the layout between DISP_IOC_BEGIN_UPDATE and END_UPDATE
  bool batching = false;  ///< between the two
  RegisterFile codec = codec_at_power_up();
  RegisterFile video_input = video_input_at_power_up();
  DecoderChips decoders;
  BoardController controller;
  std::array<u16, kChannels> motion_level{};
  std::optional<u32> scripted_motion;
  u32 selected_buffer = 0;
  u32 session = 0;                                     ///< counts starts and stops of encoding
  nanoseconds encoding_since{0};                       ///< card time of ENC_IOC_START
  nanoseconds supplied_since{0};                       ///< card time at which a supply was set
  std::deque<std::pair<u32, long>> scripted_previews;  ///< index and result of the next preview reads
  BoardSettings();
};

/// The four preview pictures and which of them is where.
struct PreviewBuffers {
  std::optional<u32> newest;  ///< holds the last picture composed
  long size = 0;              ///< its bytes
  std::optional<u32> handed;  ///< last handed to the host, which may still be looking at it
  std::uint64_t composed = 0;

  /// Where the next picture goes: the next in turn, past the one the host has.
  u32 next() const;
};

struct Board {
  Board();

  /// Everything as built. Only while nothing is open.
  void reset();
  /// What the three devices do with a standard. Needs `mutex`.
  long set_standard(u32 standard);
  /// A write to a register of the codec chip, with what hangs on it. Needs `mutex`.
  void write_codec(u32 address, u32 value);
  void write_video_input(u32 address, u32 value);
  void write_decoder(unsigned chip, unsigned address, u8 value);
  /// What ENC_IOC_STOP does. Needs `mutex`.
  void stop_encoding();
  /// Drops what was encoded in another session than this one: a stop can come while a field is being
  /// encoded, and its frames must not open the next recording.
  void drop_frames_of_other_session(u32 session);
  /// What a driver does when its last node is closed: nothing is left running.
  void last_close();
  /// Back to the card's own encoders.
  void clear_supply();
  /// How long a read may wait for its stream.
  microseconds read_wait() const;
  /// The card has been pulled out for now.
  bool vanished() const;

  std::mutex mutex;  ///< guards `settings` and `preview`
  BoardSettings settings;
  PreviewBuffers preview;
  std::atomic<bool> encoding{false};  ///< settings.state.encoding, for the reads
  std::atomic<bool> supplied{false};  ///< ready-made frames take the encoders' place
  std::atomic<bool> nowait{false};    ///< reads of an empty stream return at once

  Options options;  ///< constant after power-up, but for reset()
  Clock clock;
  Injector injector;
  CallLog log;
  Stream mpeg4;
  Stream mjpeg;
  Stream audio;
  Region stream_region{"zarvo_enc0", driver::kStreamRegionSize};
  Region preview_region{"zarvo_disp0", driver::kPreviewBuffers *driver::kPreviewBufferSize};
  Region audio_region{"zarvo_g723_0", 0};
  Region video_input_region{"zarvo_vin0", 0};
  Engine engine;
};

}  // namespace virtual_card

#endif
