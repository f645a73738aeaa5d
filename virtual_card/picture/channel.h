/**
 * @file channel.h
 * One channel from its camera to its encoders.
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

  /// What a field asks of the channel.
  struct Work {
    std::optional<EncodedSize> size;  ///< a picture of this size is due
    bool look = false;                ///< for motion

    bool any() const { return size.has_value() || look; }
  };
  /// Also notices what has been switched on or off since the field before.
  Work work(const CardState &state, std::int64_t field);
  void process(const CardState &state, const Field &field, const Work &work);
  /// Brings the camera's picture up to date without anything behind it.
  void draw(const CardState &state, const Field &field);

  struct Output {
    Mpeg4Frame mpeg4;
    EncodedSize size{};
    std::vector<u8> jpeg;
  };
  /// What the last process() has encoded; empty where it could not.
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
