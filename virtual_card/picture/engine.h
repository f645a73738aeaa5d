/**
 * @file engine.h
 * The card's picture side: cameras, encoders, motion detection and the preview compositor, driven
 * one field at a time. It knows no device nodes and no clock.
 */
#ifndef VIRTUAL_CARD_ENGINE_H
#define VIRTUAL_CARD_ENGINE_H

#include <memory>
#include <span>
#include <string>

#include "card_state.h"
#include "field.h"
#include "frame_queue.h"

namespace virtual_card {

class Engine {
 public:
  Engine(FrameQueue &mpeg4, FrameQueue &mjpeg, FrameQueue &audio);
  ~Engine();

  /// Draws, detects, encodes and queues what is due at this field. Called from one thread at a time;
  /// works on threads of its own inside and returns when all is done. The result is deterministic.
  void field(const CardState &state, const Field &field);
  /// Encodes one 128-sample block of each audio input and queues the four blocks as one frame.
  /// `block` counts blocks since power-up (62.5 a second).
  void audio_block(const CardState &state, std::int64_t block);

  /// Composes the newest preview picture into `uyvy` (width x lines x 2 bytes), from the pictures of
  /// the last field. Same thread rule as field().
  void compose(const CardState &state, std::span<u8> uyvy);

  /// Channels with motion, as of the last field that was looked at. Any thread.
  u32 motion() const;
  /// Writes thresholds, columns x rows values, into a channel's map. Any thread.
  void set_thresholds(const driver::MotionMap &map);
  /// Sets the whole map of a channel. Any thread.
  void set_threshold(unsigned channel, u16 level);
  /// Puts a film in front of a camera, or takes it away with an empty path. Any thread.
  bool show_film(unsigned channel, const std::string &path, std::string *error);

  /// Ends the threads inside, until the next field or preview. Same thread rule as field().
  void rest();
  /// Encoders, maps, films and pictures as at power-up.
  void reset();

 private:
  struct Parts;
  std::unique_ptr<Parts> parts_;
};

}  // namespace virtual_card

#endif
