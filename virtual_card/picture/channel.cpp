// Draws, detects and encodes the fields of a channel.
#include "channel.h"

#include <algorithm>
#include <new>

namespace virtual_card {

namespace {

constexpr u32 kOverlayHeight = 20;  ///< lines of a digit in pictures of one field
constexpr std::size_t kMaxMpeg4 =
    std::min<std::size_t>(driver::kMpeg4LengthMask, driver::kMpeg4AreaSize - driver::kMpeg4DescriptorSize);
constexpr std::size_t kMaxJpeg = driver::kMjpegReadSize - driver::kMjpegDescriptorSize;

}  // namespace

Channel::Work Channel::work(const CardState &state, std::int64_t field) {
  const ChannelState &channel = state.channel[number_];
  Work work;
  const auto size =
      state.encoding ? encoded_size(channel.encoder.scale_code, state.width, state.lines()) : std::nullopt;
  if (!size) {
    mpeg4_.reset();
  } else if (picture_due(channel.encoder.interval_code, size->interlaced, field)) {
    work.size = size;
  }
  const bool detect = ((state.motion_enable >> number_) & 1) != 0 && !channel.lost;
  if (detect != detecting_) motion_.forget();
  detecting_ = detect;
  work.look = detect && MotionDetector::looks_at(field);
  return work;
}

void Channel::adjust(const CardState &state) {
  // A change of the settings changes the picture but is not motion.
  if (camera_.adjust(state)) motion_.forget();
}

void Channel::draw(const CardState &state, const Field &field) {
  adjust(state);
  camera_.draw(field);
}

void Channel::process(const CardState &state, const Field &field, const Work &work) {
  try {
    adjust(state);
    if (work.size && work.size->interlaced) camera_.draw(field.before());
    camera_.draw(field);
    if (work.look) motion_.look(camera_.picture(), field.number);
    if (work.size) encode(state, field.parity(), *work.size);
  } catch (const std::bad_alloc &) {
    lose_output();
  }
}

/// Drops the output and the encoder: the next frame must not reference a dropped frame.
void Channel::lose_output() {
  mpeg4_.reset();
  output_.mpeg4.bitstream.clear();
  output_.jpeg.clear();
}

void Channel::encode(const CardState &state, u32 parity, EncodedSize size) {
  const EncoderSettings &encoder = state.channel[number_].encoder;
  scale_picture(camera_.picture(), parity, size, picture_);
  if (encoder.number_overlay) {
    const u32 height = size.interlaced ? 2 * kOverlayHeight : kOverlayHeight;
    if (!overlay_ || overlay_->height() != height) overlay_.emplace(height);
    burn_number(picture_, number_, *overlay_);
  }

  const double rate = picture_rate(encoder.interval_code, size.interlaced, state.standard);
  const Mpeg4Settings settings = mpeg4_settings(encoder, size, rate);
  if (!mpeg4_ || mpeg4_->settings() != settings) mpeg4_.emplace(settings);
  output_.size = size;
  output_.mpeg4 = mpeg4_->encode(picture_);
  if (output_.mpeg4.bitstream.empty() || output_.mpeg4.bitstream.size() > kMaxMpeg4) {
    output_.mpeg4.bitstream.clear();
    mpeg4_.reset();  // the next frame must not reference a dropped frame
  }
  if (!jpeg_) jpeg_.emplace();
  output_.jpeg = jpeg_->encode(picture_, fine_quality(state.mjpeg_quality));
  if (output_.jpeg.size() > kMaxJpeg) output_.jpeg.clear();
}

}  // namespace virtual_card
