/**
 * @file engine.h
 * The engine: cameras, encoders, motion detection and preview compositor, called once for each field. It
 * knows no device nodes and no clock.
 */
#ifndef VIRTUAL_CARD_ENGINE_H
#define VIRTUAL_CARD_ENGINE_H

#include <memory>
#include <span>
#include <string>

#include "card_state.h"
#include "field.h"
#include "frame_queue.h"
#include "motion_detector.h"
#include "picture.h"

namespace virtual_card {

/// Call the functions from one thread at a time, except those marked "Any thread".
class Engine {
 public:
  Engine(FrameQueue &mpeg4, FrameQueue &mjpeg, FrameQueue &audio);
  ~Engine();

  /// Draws, detects, encodes and queues everything that is due at this field. It uses threads of its own and
  /// returns when all is done. The result is deterministic.
  void field(const CardState &state, const Field &field);
  /// Encodes one 128-sample block of each audio input and queues the four blocks as one frame.
  /// `block` counts blocks since power-up (62.5 a second).
  void audio_block(const CardState &state, std::int64_t block);

  /// Composes the newest preview picture from the last fields into `uyvy`, width x lines x 2 bytes.
  void compose(const CardState &state, std::span<u8> uyvy);

  /// Draws and returns what a camera shows in the last complete frame.
  Picture look(const CardState &state, unsigned channel);

  /// Returns the mask of channels with motion at the last field. Any thread.
  u32 motion() const;
  /// Writes thresholds into a rectangle of a channel's map. Any thread.
  void set_thresholds(const driver::MotionMap &map);
  /// Sets all thresholds of a channel's map. Any thread.
  void set_threshold(unsigned channel, u16 level);
  /// Returns a channel's map. Any thread.
  MotionThresholds thresholds(unsigned channel) const;
  /// Puts a film in front of a camera; an empty path removes it. Returns false, with the reason in `error`,
  /// when the file cannot be read as video. Any thread.
  bool show_film(unsigned channel, const std::string &path, std::string *error);

  /// Ends the engine's threads; the next field or preview starts them again.
  void rest();
  /// Restores the power-up state of encoders, maps, films and pictures.
  void reset();

 private:
  struct Parts;
  std::unique_ptr<Parts> parts_;
};

}  // namespace virtual_card

#endif
