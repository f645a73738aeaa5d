// Runs fields, audio blocks, preview pictures and supplies when they are due.
#include "runner.h"

#include <algorithm>
#include <cerrno>
#include <new>
#include <system_error>
#include <utility>

#include "host/message.h"
#include "host/threads.h"
#include "picture/encoded_picture.h"

namespace virtual_card {
namespace {

constexpr nanoseconds kNever = nanoseconds::max();

std::int64_t audio_block_at(nanoseconds time) {
  return (time + kAudioBlock - nanoseconds{1}) / kAudioBlock;
}

/// Returns how many pictures a channel would have encoded in a range of fields.
std::uint64_t pictures_between(const EncoderSettings &encoder, std::int64_t first, std::int64_t end) {
  std::uint64_t pictures = 0;
  if (encoder.scale_code == 0) return pictures;
  for (std::int64_t field = first; field < end; ++field)
    if (picture_due(encoder.interval_code, encoder.scale_code == driver::kScaleCodeD1, field)) ++pictures;
  return pictures;
}

}  // namespace

long Runner::start() {
  if (thread_.joinable() || board_.clock.mode() == ClockMode::manual) return 0;
  {
    const std::lock_guard lock(run_mutex_);
    const nanoseconds now = board_.clock.now();
    field_ = std::max(field_, schedule_.first_at(now));
    audio_block_ = std::max(audio_block_, audio_block_at(now));
    ending_ = false;
  }
  try {
    thread_ = start_thread([this] { loop(); });
  } catch (const std::system_error &error) {
    return -error.code().value();
  } catch (const std::bad_alloc &) {
    return -ENOMEM;
  }
  return 0;
}

void Runner::stop() {
  ending_ = true;
  {
    // The thread releases the mutex only when it waits or ends. Taking it once makes sure that the signal
    // below does not come before the wait.
    const std::lock_guard lock(run_mutex_);
  }
  signal_.notify_all();
  if (thread_.joinable()) thread_.join();
  board_.engine.rest();
}

void Runner::power_up() {
  const std::lock_guard lock(run_mutex_);
  schedule_ = FieldSchedule{};
  field_ = 0;
  audio_block_ = 0;
  for (Pace *pace : {&video_pace_, &audio_pace_}) pace->count = 0;
}

void Runner::loop() {
  std::unique_lock lock(run_mutex_);
  while (!ending_) {
    const nanoseconds now = board_.clock.now();
    const Next first = next();
    if (now - first.due > board_.clock.second())
      skip_to(now);
    else if (first.due <= now)
      run(first);
    const MonotonicTime wake = board_.clock.when(next().due);
    if (!ending_ && monotonic_now() < wake) signal_.wait_until(lock, wake);
  }
}

void Runner::advance(nanoseconds time) {
  if (board_.clock.mode() != ClockMode::manual) return;
  const std::lock_guard lock(run_mutex_);
  run_until(board_.clock.now() + time);
}

void Runner::advance_frames(int frames) {
  if (board_.clock.mode() != ClockMode::manual) return;
  const std::lock_guard lock(run_mutex_);
  next();  // applies a change of the standard
  run_until(schedule_.due(field_ + 2 * std::int64_t{frames}));
}

void Runner::run_until(nanoseconds time) {
  for (Next first = next(); first.due < time; first = next()) {
    board_.clock.move_to(first.due);
    run(first);
  }
  board_.clock.move_to(time);
  board_.refresh(time);
  watch(time);
}

CardState Runner::snapshot(u32 *session) {
  const std::lock_guard lock(board_.mutex);
  if (session != nullptr) *session = board_.settings.session;
  return board_.settings.state;
}

Runner::Next Runner::next() {
  const CardState state = snapshot();
  if (state.standard != schedule_.standard()) schedule_.change_standard(state.standard, field_);
  const Next all[] = {{Event::change, board_.next_change()},
                      {Event::field, schedule_.due(field_)},
                      {Event::audio, audio_block_ * kAudioBlock},
                      {Event::video_supply, pace_due(video_pace_, state)},
                      {Event::audio_supply, pace_due(audio_pace_, state)}};
  return *std::min_element(std::begin(all), std::end(all),
                           [](const Next &a, const Next &b) { return a.due < b.due; });
}

nanoseconds Runner::pace_due(Pace &pace, const CardState &state) {
  double rate = 0;
  for (const Stream *stream : pace.streams)
    if (stream != nullptr) rate = std::max(rate, stream->pace());
  if (!state.encoding || rate <= 0) return kNever;
  const nanoseconds since = [&] {
    const std::lock_guard lock(board_.mutex);
    return std::max(board_.settings.encoding_since, board_.settings.supplied_since);
  }();
  if (since != pace.since) pace.count = 0;
  pace.since = since;
  return since + nanoseconds{static_cast<std::int64_t>(static_cast<double>(pace.count) * 1e9 / rate)};
}

void Runner::run(const Next &next) {
  try {
    run_event(next);
  } catch (const std::bad_alloc &) {
    // The event's counter has already advanced, so the next event follows.
  }
}

void Runner::run_event(const Next &next) {
  const auto supply = [](Pace &pace) {
    ++pace.count;
    for (Stream *stream : pace.streams)
      if (stream != nullptr) stream->supply_due();
  };
  switch (next.event) {
    case Event::change:
      return board_.refresh(next.due);
    case Event::field:
      return run_field();
    case Event::audio:
      return run_audio_block();
    case Event::video_supply:
      return supply(video_pace_);
    case Event::audio_supply:
      return supply(audio_pace_);
  }
}

void Runner::run_field() {
  {
    const std::lock_guard lock(board_.mutex);
    if (board_.conditions.flicker != 0) board_.set_signals(field_);
  }
  u32 session = 0;
  CardState state = snapshot(&session);
  const bool supplied = board_.supplied;
  if (supplied) state.encoding = false;
  const std::int64_t field = field_++;
  const nanoseconds due = schedule_.due(field);
  watch(due);
  board_.engine.field(state, {state.standard, field, board_.clock.wall(due)});
  if (state.encoding) board_.drop_frames_of_other_session(session);
  if (field % 2 != 0 && state.display.on) compose(state);
}

void Runner::run_audio_block() {
  u32 session = 0;
  const CardState state = snapshot(&session);
  const std::int64_t block = audio_block_++;
  if (!state.encoding || board_.supplied) return;
  board_.engine.audio_block(state, block);
  board_.drop_frames_of_other_session(session);
}

void Runner::compose(const CardState &state) {
  const u32 buffer = [&] {
    const std::lock_guard lock(board_.mutex);
    return board_.preview.next();
  }();
  bool composed = false;
  const std::size_t size = std::size_t{state.width} * state.lines() * 2;
  board_.preview_region.with_bytes([&](std::span<u8> bytes) {
    board_.engine.compose(state, bytes.subspan(buffer * driver::kPreviewBufferSize, size));
    composed = true;
  });
  const std::lock_guard lock(board_.mutex);
  if (!composed || !board_.settings.state.display.on) return;
  board_.preview.newest = buffer;
  board_.preview.size = static_cast<long>(size);
  ++board_.preview.composed;
}

Picture Runner::look(unsigned channel) {
  const std::lock_guard lock(run_mutex_);
  return board_.engine.look(snapshot(), channel);
}

void Runner::watch(nanoseconds now) {
  const std::lock_guard lock(board_.mutex);
  if (board_.settings.controller.expired(now)) print_message("the watchdog would have reset the machine");
}

void Runner::skip_to(nanoseconds now) {
  board_.refresh(now);
  const CardState state = snapshot();
  const std::int64_t field = schedule_.first_at(now);
  const std::int64_t block = audio_block_at(now);
  if (state.encoding && !board_.supplied) {
    std::uint64_t frames = 0;
    for (const ChannelState &channel : state.channel)
      frames += pictures_between(channel.encoder, field_, field);
    board_.mpeg4.queue.missed(frames);
    board_.mjpeg.queue.missed(frames);
    if (block > audio_block_) board_.audio.queue.missed(static_cast<std::uint64_t>(block - audio_block_));
  }
  field_ = std::max(field_, field);
  audio_block_ = std::max(audio_block_, block);
  for (Pace *pace : {&video_pace_, &audio_pace_}) {
    while (pace_due(*pace, state) < now) {
      ++pace->count;
      for (Stream *stream : pace->streams)
        if (stream != nullptr && stream->pace() > 0) stream->queue.missed(1);
    }
  }
}

}  // namespace virtual_card
