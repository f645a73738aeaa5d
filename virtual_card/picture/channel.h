/**
 * @file channel.h
 * One channel: camera, motion detector and encoders.
 */
#ifndef VIRTUAL_CARD_CHANNEL_H
#define VIRTUAL_CARD_CHANNEL_H

#include <optional>
#include <vector>

#include "camera.h"
#include "encoded_picture.h"
#include "jpeg_encoder.h"
#include "motion_detector.h"
#include "mpeg4_encoder.h"

namespace virtual_card {

class Channel {
 public:
  explicit Channel(unsigned number) : number_(number), camera_(number) {}

  /// The work that a field needs on this channel.
  struct Work {
    std::optional<EncodedSize> size;  ///< size of the picture to encode, if one is due
    bool look = false;                ///< detect motion

    bool any() const { return size.has_value() || look; }
  };
  /// Returns the work for a field. Also resets the encoder or the motion detector when encoding or detection
  /// has been switched off or on since the field before.
  Work work(const CardState &state, std::int64_t field);
  void process(const CardState &state, const Field &field, const Work &work);
  /// Only draws the field, without detection and encoding.
  void draw(const CardState &state, const Field &field);

  struct Output {
    Mpeg4Frame mpeg4;
    EncodedSize size{};
    std::vector<u8> jpeg;
  };
  /// Returns the output of the last process(); a stream that could not be encoded is empty.
  const Output &output() const { return output_; }

  Camera &camera() { return camera_; }
  MotionDetector &motion() { return motion_; }

 private:
  void adjust(const CardState &state);
  void encode(const CardState &state, u32 parity, EncodedSize size);
  void lose_output();

  unsigned number_;
  Camera camera_;
  MotionDetector motion_;
  bool detecting_ = false;
  EncodedPicture picture_;
  std::optional<Mpeg4Encoder> mpeg4_;
  std::optional<JpegEncoder> jpeg_;
  std::optional<Font> overlay_;
  Output output_;
};

}  // namespace virtual_card

#endif
