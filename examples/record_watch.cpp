// Tells what happens while zarvo_record records.
#include "record_watch.h"

#include <unistd.h>

#include <cstdio>

namespace {

constexpr auto kSilence = std::chrono::seconds(2);  // a stream that brings nothing for so long has stopped
constexpr auto kProgressPeriod = std::chrono::seconds(1);

double seconds_of(Clock::duration time) {
  return std::chrono::duration<double>(time).count();
}

}  // namespace

Watch::Watch(std::span<const Stream> streams, Clock::time_point start)
    : streams_(streams),
      stopped_(streams.size()),
      terminal_(isatty(STDERR_FILENO) == 1),
      start_(start),
      shown_(start) {}

Watch::~Watch() {
  clear_progress();
}

void Watch::look() {
  const auto now = Clock::now();
  tell_stopped(now);
  if (terminal_ && now - shown_ >= kProgressPeriod) show_progress(now);
}

void Watch::tell_stopped(Clock::time_point now) {
  for (std::size_t n = 0; n < streams_.size(); ++n) {
    const Clock::duration silence = streams_[n].silence(now);
    if (!streams_[n].is_chosen() || stopped_[n] == (silence > kSilence)) continue;
    stopped_[n] = !stopped_[n];
    clear_progress();
    const char *const name = streams_[n].name().c_str();
    if (stopped_[n]) {
      std::fprintf(stderr, "zarvo_record: %s: nothing has come for %.0f s\n", name, seconds_of(silence));
    } else {
      std::fprintf(stderr, "zarvo_record: %s: goes on\n", name);
    }
  }
}

void Watch::show_progress(Clock::time_point now) {
  std::uint64_t frames = 0, bytes = 0, missing = 0;
  for (const Stream &stream : streams_) {
    if (stream.is_video()) frames += stream.frames();
    bytes += stream.bytes();
    if (stream.incomplete(seconds_of(now - start_))) missing += stream.missing(seconds_of(now - start_));
  }
  const double period = seconds_of(now - shown_);
  std::fprintf(stderr, "\r%.0f s: %.0f frames/s, %.0f kbit/s, %ju missing\033[K", seconds_of(now - start_),
               static_cast<double>(frames - frames_) / period,
               static_cast<double>(bytes - bytes_) * 8 / 1000 / period, missing);
  shown_ = now;
  frames_ = frames;
  bytes_ = bytes;
}

void Watch::clear_progress() const {
  if (terminal_) std::fputs("\r\033[K", stderr);
}
