// Takes frames from the SDK's threads.
#include "intake.h"

#include <algorithm>
#include <cstring>

namespace recorder {
namespace {

/// The share of the audio buffer: 32 times as small, which is longer in time than that of CIF video.
constexpr std::size_t kAudioShare = 32;

/// Returns whether an MPEG-4 frame is intra. Its picture start code is at the beginning, or behind the 20
/// bytes of the stream header; the two bits behind the code are 0 for an intra picture.
bool is_intra(const u8 *data, std::size_t length) {
  constexpr u8 kPictureStart[] = {0, 0, 1, 0xB6};
  constexpr std::size_t kSearched = 64;
  const u8 *const end = data + std::min(length, kSearched);
  const u8 *const start = std::search(data, end, std::begin(kPictureStart), std::end(kPictureStart));
  return end - start > 4 && start[4] >> 6 == 0;
}

/// Adds to a count that only this thread writes.
void add(std::atomic<std::uint64_t> &count, std::uint64_t more) {
  count.store(count.load(std::memory_order_relaxed) + more, std::memory_order_relaxed);
}

}  // namespace

Intake::Intake(const Options &options)
    : chosen_(options.channels | options.audio << ZV_CHANNELS),
      mpeg4_(options.codec == VIDEO_CODEC_ZV_MPEG4),
      video_rate_(stream_rate(options, 0)),
      audio_rate_(stream_rate(options, ZV_CHANNELS)),
      memory_(std::make_unique<std::byte[]>(options.buffer)),
      video_({memory_.get(), options.buffer - options.buffer / kAudioShare}),
      audio_({memory_.get() + video_.capacity(), options.buffer / kAudioShare}) {}

Clock::duration Intake::gap_limit(unsigned stream) const {
  constexpr std::chrono::duration<double> kLeast{0.2};
  const std::chrono::duration<double> two_periods{2 / rate(stream)};
  return std::chrono::duration_cast<Clock::duration>(std::max(kLeast, two_periods));
}

std::uint32_t Intake::silence_ms(unsigned stream, Clock::time_point now) const {
  const Clock::rep last = arrivals_[stream].last.load(std::memory_order_relaxed);
  const Clock::duration silence = now.time_since_epoch() - Clock::duration{last};
  if (last == 0 || silence <= gap_limit(stream)) return 0;
  return static_cast<std::uint32_t>(std::chrono::duration_cast<std::chrono::milliseconds>(silence).count());
}

std::uint32_t Intake::note_arrival(const Frame &frame) {
  Arrivals &arrivals = arrivals_[frame.stream];
  const Clock::time_point now = Clock::now();
  const Clock::rep ticks = now.time_since_epoch().count();
  const std::uint32_t gap_ms = silence_ms(frame.stream, now);
  if (arrivals.last.exchange(ticks, std::memory_order_relaxed) == 0)
    arrivals.first.store(ticks, std::memory_order_relaxed);
  add(arrivals.frames, 1);
  add(arrivals.bytes, frame.length);
  add(arrivals.motion, frame.motion ? 1 : 0);
  add(arrivals.no_signal, frame.no_signal ? 1 : 0);
  if (gap_ms == 0) return 0;
  add(arrivals.gaps, 1);
  arrivals.longest_gap_ms = std::max<std::uint64_t>(arrivals.longest_gap_ms, gap_ms);
  return gap_ms;
}

void Intake::take(unsigned stream, const u8 *data, i32 length, i32 flags) {
  if (!records(stream)) return;
  Frame frame{};
  frame.time = wall_ms();
  frame.length = static_cast<std::uint32_t>(length);
  frame.stream = static_cast<std::uint8_t>(stream);
  frame.intra = !is_video(stream) || !mpeg4_ || is_intra(data, frame.length);
  frame.motion = (flags & ZV_FLAG_MOTION) != 0;
  frame.no_signal = (flags & ZV_FLAG_VIDEO_LOSS) != 0;

  Loss &loss = losses_[stream];
  loss.gap_ms += note_arrival(frame);
  frame.gap_ms = loss.gap_ms;
  frame.lost = loss.frames;
  Ring &ring = is_video(stream) ? video_ : audio_;
  if ((!loss.skipping || frame.intra) && ring.push(frame, data)) {
    loss = {};
  } else {
    loss.skipping = true;
    ++loss.frames;
    add(arrivals_[stream].lost, 1);
  }
}

std::uint64_t Intake::expected(unsigned stream, Clock::time_point now) const {
  const Clock::rep first = arrivals_[stream].first;
  if (first == 0) return 0;
  const std::chrono::duration<double> elapsed = now.time_since_epoch() - Clock::duration{first};
  return static_cast<std::uint64_t>(rate(stream) * elapsed.count()) + 1;
}

}  // namespace recorder
