// Looks at a running capture.
#include "live.h"

#include <mutex>
#include <stdexcept>

#include "bench.h"
#include "decode.h"
#include "programs/common/card.h"

namespace contract {
namespace {

std::mutex newest_mutex;  // guards what the callbacks fill
std::array<Frame, ZV_CHANNELS> newest;
std::array<Live::Tags, ZV_CHANNELS> counted;

void on_picture(u32 channel, u8 *data, i32 length, i32 flags) {
  const std::lock_guard lock(newest_mutex);
  newest.at(channel) = {monotonic_seconds(), static_cast<u32>(flags), {data, data + length}};
}

void on_frame(u32 channel, u8 *, i32, i32 flags) {
  const std::lock_guard lock(newest_mutex);
  ++counted.at(channel).frames;
  if ((flags & ZV_FLAG_MOTION) != 0) ++counted.at(channel).with_motion;
}

}  // namespace

u32 first_channel(u32 mask) {
  u32 channel = 0;
  while (channel < ZV_CHANNELS - 1 && (mask >> channel & 1) == 0) ++channel;
  return channel;
}

Live::Live(HANDLE card, u32 channels) : card_(card) {
  const ZV_VIDEO_CONFIG config = cif_config();
  for (u32 n = 0; n < ZV_CHANNELS; ++n)
    if ((channels >> n & 1) != 0) check(zv_SetVideoEncodeConfig(card, n, &config), "zv_SetVideoEncodeConfig");
  newest = {};
  check(zv_EnableVideoRecordChannels(card, channels), "zv_EnableVideoRecordChannels");
  check(zv_RegisterCallBack(card, on_frame, on_picture, nullptr), "zv_RegisterCallBack");
  check(zv_Start(card), "zv_Start");
}

Live::~Live() {
  zv_Stop(card_);
}

Image Live::picture(u32 channel) {
  // The card may have drawn the next pictures before the call.
  constexpr double kSettle = 0.2, kPoll = 0.01, kLimit = 2.0;
  const double start = monotonic_seconds();
  while (monotonic_seconds() - start < kLimit) {
    pause_for(kPoll);
    Frame frame{};
    {
      const std::lock_guard lock(newest_mutex);
      frame = newest.at(channel);
    }
    if (frame.time < start + kSettle) continue;
    Image image = decode_jpeg(frame);
    if (!image.empty()) return image;
  }
  throw std::runtime_error("no Motion-JPEG picture that decodes comes from channel " +
                           std::to_string(channel + 1));
}

Live::Tags Live::tags(u32 channel, double seconds) {
  {
    const std::lock_guard lock(newest_mutex);
    counted.at(channel) = {};
  }
  pause_for(seconds);
  const std::lock_guard lock(newest_mutex);
  return counted.at(channel);
}

}  // namespace contract
