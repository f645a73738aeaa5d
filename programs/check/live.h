/**
 * @file live.h
 * A running capture whose newest pictures and flags a check can look at while it changes settings.
 */
#ifndef CONTRACT_LIVE_H
#define CONTRACT_LIVE_H

#include <memory>

#include "image.h"
#include "recording.h"

namespace contract {

class Live {
 public:
  /// Captures CIF pictures of these channels at the full rate.
  Live(HANDLE card, u32 channels);
  ~Live();
  Live(const Live &) = delete;
  Live &operator=(const Live &) = delete;

  /// Returns a picture that the card has made after this call. Throws std::runtime_error if none comes.
  Image picture(u32 channel);

  struct Tags {
    u32 frames = 0;
    u32 with_motion = 0;
  };
  /// Counts the frames of a channel and their motion flags for a time.
  Tags tags(u32 channel, double seconds);

 private:
  HANDLE card_;
};

/// The first of the channels in a mask.
u32 first_channel(u32 mask);

}  // namespace contract

#endif
