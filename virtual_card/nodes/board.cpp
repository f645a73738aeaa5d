// The state that the device nodes share: settings, preview buffers, power-up and last close.
#include "board.h"

#include <cerrno>

namespace virtual_card {
namespace {

constexpr std::size_t kVideoQueue = 4u << 20;  // bytes
constexpr std::size_t kAudioQueue = 64 * kAudioInputs * driver::kAudioBlockSize;
constexpr microseconds kReadWait = std::chrono::milliseconds{10};

}  // namespace

BoardSettings::BoardSettings() {
  motion_level.fill(kDefaultMotionLevel);
  for (u32 n = 0; n < kChannels; ++n) {
    state.display.layout.window[n].index = n;
    state.display.layout.window[n].channel = n;
    state.display.routing[n] = n;
    state.channel[n].mask.channel = n;
  }
}

u32 PreviewBuffers::next() const {
  u32 buffer = newest.value_or(driver::kPreviewBuffers - 1);
  do {
    buffer = (buffer + 1) % driver::kPreviewBuffers;
  } while (buffer == handed);
  return buffer;
}

Board::Board()
    : mpeg4(kVideoQueue),
      mjpeg(kVideoQueue),
      audio(kAudioQueue),
      engine(mpeg4.queue, mjpeg.queue, audio.queue) {}

void Board::reset() {
  const std::lock_guard lock(mutex);
  settings = BoardSettings{};
  preview = PreviewBuffers{};
  encoding = false;
  nowait = false;
  options = Options{};
  clock.power_up(ClockMode::real_time, 1.0);
  injector.reset();
  log.record(false);
  clear_supply();
  for (Stream *stream : {&mpeg4, &mjpeg, &audio}) {
    stream->queue.clear();
    stream->queue.reset_counters();
  }
  engine.reset();
}

long Board::set_standard(u32 standard) {
  if (standard > VIDEO_STANDARD_ZV_PAL) return -EINVAL;
  settings.state.standard = standard;
  return 0;
}

void Board::write_codec(u32 address, u32 value) {
  settings.codec.write(address, value);
  settings.state.motion_enable = settings.codec.read(driver::kRegMotionEnable) >> driver::kMotionEnableShift;
  settings.state.mjpeg_quality = settings.codec.read(driver::kRegMjpegQuality);
}

void Board::write_video_input(u32 address, u32 value) {
  settings.video_input.write(address, value);
  for (u32 n = 0; n < kChannels; ++n) {
    settings.state.channel[n].mask =
        driver::unpacked_mask(n, settings.video_input.read(driver::kRegPrivacyMask + 4 * n));
    settings.state.display.routing[n] =
        settings.video_input.read(driver::kRegRouting + 4 * n) >> driver::kRoutingShift;
  }
}

void Board::write_decoder(unsigned chip, unsigned address, u8 value) {
  settings.decoders.write(chip, address, value);
  for (unsigned n = 0; n < kChannels; ++n) settings.state.channel[n].picture = settings.decoders.picture(n);
}

void Board::stop_encoding() {
  settings.state.encoding = false;
  encoding = false;
  ++settings.session;
  for (Stream *stream : {&mpeg4, &mjpeg, &audio}) {
    stream->queue.clear();
    stream->queue.wake();
  }
}

void Board::drop_frames_of_other_session(u32 session) {
  const std::lock_guard lock(mutex);
  if (session == settings.session) return;
  for (Stream *stream : {&mpeg4, &mjpeg, &audio}) stream->queue.clear();
}

void Board::last_close() {
  const std::lock_guard lock(mutex);
  if (encoding) stop_encoding();
  settings.state.display.on = false;
  settings.batching = false;
  preview.newest.reset();
  preview.handed.reset();
}

void Board::clear_supply() {
  for (Stream *stream : {&mpeg4, &mjpeg, &audio}) stream->clear_supply();
  supplied = false;
}

microseconds Board::read_wait() const {
  return encoding.load(std::memory_order_relaxed) && !nowait.load(std::memory_order_relaxed)
             ? kReadWait
             : microseconds{0};
}

bool Board::vanished() const {
  if (options.vanish_to == nanoseconds{0}) return false;
  const nanoseconds now = clock.now();
  return options.vanish_from <= now && now < options.vanish_to;
}

}  // namespace virtual_card
