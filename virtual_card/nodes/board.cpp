// The state that the device nodes share: settings, preview buffers, power-up and last close.
#include "board.h"

#include <cerrno>

#include "host/message.h"

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
    : mpeg4(StreamKind::mpeg4, kVideoQueue),
      mjpeg(StreamKind::mjpeg, kVideoQueue),
      audio(StreamKind::audio, kAudioQueue),
      engine(mpeg4.queue, mjpeg.queue, audio.queue) {}

void Board::reset() {
  apply("reset");
  const std::lock_guard lock(mutex);
  settings = BoardSettings{};
  preview = PreviewBuffers{};
  encoding = false;
  power_up_error.clear();
  clock.power_up(ClockMode::real_time, 1.0);
  call_faults.reset_hits();
  log.record(false);
  clear_supply();
  for (Stream *stream : {&mpeg4, &mjpeg, &audio}) {
    stream->clear();
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
  if (conditions.stuck.contains(address)) return;
  settings.codec.write(address, value);
  settings.state.motion_enable = settings.codec.read(driver::kRegMotionEnable) >> driver::kMotionEnableShift;
  settings.state.mjpeg_quality = settings.codec.read(driver::kRegMjpegQuality);
}

void Board::write_video_input(u32 address, u32 value) {
  if (conditions.stuck.contains(address)) return;
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
  for (Stream *stream : {&mpeg4, &mjpeg, &audio}) stream->end_session();
}

void Board::drop_frames_of_other_session(u32 session) {
  const std::lock_guard lock(mutex);
  if (session == settings.session) return;
  for (Stream *stream : {&mpeg4, &mjpeg, &audio}) stream->clear();
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

std::string Board::apply(std::string_view line, PowerUp *power_up) {
  const std::lock_guard lock(script_mutex_);
  const nanoseconds now = clock.now();
  std::string error = script_.add(line, now, power_up);
  if (error.empty()) change_conditions(now);
  return error;
}

void Board::refresh(nanoseconds now) {
  if (now < next_change()) return;
  const std::lock_guard lock(script_mutex_);
  change_conditions(now);
}

void Board::change_conditions(nanoseconds now) {
  const Conditions next = script_.conditions(now);
  next_change_ = script_.next_change(now).count();
  for (unsigned n = 0; n < kChannels; ++n) {
    const auto film_of = [n](const Conditions &each) {
      const auto film = each.films.find(n);
      return film == each.films.end() ? std::string{} : film->second;
    };
    std::string reason;
    if (film_of(next) != film_of(conditions) && !engine.show_film(n, film_of(next), &reason))
      print_message("item \"camera%u\": %s", n + 1, reason.c_str());
  }
  set_conditions(next);
}

void Board::set_conditions(const Conditions &next) {
  const std::lock_guard lock(mutex);
  if (next.seed != conditions.seed) random_.seed(next.seed);
  conditions = next;
  CardState &state = settings.state;
  for (u32 n = 0; n < kChannels; ++n) {
    const u32 bit = 1u << n;
    state.channel[n].scene = (next.black & bit) != 0   ? Scene::black
                             : (next.still & bit) != 0 ? Scene::still
                                                       : Scene::moving;
  }
  set_signals(0);
  state.sound_present = ~next.silent & ((1u << kAudioInputs) - 1);
  settings.controller.set_version(next.board_version);
  settings.controller.set_faults(next.board_mute, next.board_wrong, next.watchdog_bites);
  nowait = next.nowait;
  absent = next.absent;
  vanished = next.vanished;
  call_faults.set(next.failing, next.delay);
  Stream *const streams[] = {&mpeg4, &mjpeg, &audio};
  for (std::size_t n = 0; n < std::size(streams); ++n) streams[n]->set_faults(next.streams[n], next.seed);
  preview_faults.set(next.streams[static_cast<std::size_t>(StreamKind::preview)], next.seed);
}

void Board::set_signals(std::int64_t field) {
  const bool off = field / conditions.flicker_fields % 2 != 0;
  const u32 lost = conditions.lost | (off ? conditions.flicker : 0);
  for (u32 n = 0; n < kChannels; ++n) settings.state.channel[n].lost = (lost >> n & 1) != 0;
}

u32 Board::read_register(const RegisterFile &registers, u32 address) {
  if (conditions.garbage.contains(address)) return static_cast<u32>(random_());
  return registers.read(address);
}

}  // namespace virtual_card
