// Watches the streams and tells their state.
#include "status.h"

#include <algorithm>
#include <cstdio>

#include "recording/wall_time.h"

namespace recorder {
namespace {

constexpr double kMiB = 1 << 20;

double seconds_of(Clock::duration time) {
  return std::chrono::duration<double>(time).count();
}

template <typename... Values>
std::string format(const char *pattern, Values... values) {
  char text[256];
  std::snprintf(text, sizeof text, pattern, values...);
  return text;
}

}  // namespace

void Status::look_for_silence(Messages &messages) {
  constexpr auto kLong = std::chrono::seconds(5);
  const Clock::time_point now = Clock::now();
  for (unsigned stream = 0; stream < kStreams; ++stream) {
    if (!recorder_.intake().records(stream)) continue;
    const Clock::rep last = recorder_.intake().arrivals(stream).last;
    const Clock::time_point since =
        last == 0 ? recorder_.start_time() : Clock::time_point(Clock::duration(last));
    const bool silent = now - since > std::max<Clock::duration>(kLong, recorder_.intake().gap_limit(stream));
    if (silent && !silent_[stream])
      messages.add(stream_name(stream) + format(": nothing has come for %.0f s", seconds_of(now - since)));
    silent_[stream] = silent;
  }
}

void Status::look_for_overrun(Messages &messages) {
  std::uint64_t lost = 0;
  for (unsigned stream = 0; stream < kStreams; ++stream) lost += recorder_.intake().arrivals(stream).lost;
  const bool overrun = lost > lost_;
  if (overrun && !overrun_)
    messages.add("the buffer is full, because the disk does not keep up: frames are lost");
  lost_ = lost;
  overrun_ = overrun;
}

Shortfall::Counts Status::counts(unsigned stream) const {
  return {recorder_.intake().arrivals(stream).frames, recorder_.intake().expected(stream, Clock::now())};
}

void Status::compare_with_expected(Messages &messages) {
  for (unsigned stream = 0; stream < kStreams; ++stream) {
    if (!recorder_.intake().records(stream)) continue;
    if (const std::string text = shortfalls_[stream].end_minute(counts(stream)); !text.empty())
      messages.add(stream_name(stream) + ": " + text);
  }
}

std::string Status::line() const {
  const Intake &intake = recorder_.intake();
  std::uint64_t frames = 0, bytes = 0, gaps = 0;
  unsigned streams = 0, silent = 0;
  for (unsigned stream = 0; stream < kStreams; ++stream) {
    if (!intake.records(stream)) continue;
    const Arrivals &arrivals = intake.arrivals(stream);
    ++streams;
    silent += silent_[stream] ? 1 : 0;
    if (is_video(stream)) frames += arrivals.frames;
    bytes += arrivals.bytes;
    gaps += arrivals.gaps;
  }
  const double used =
      100.0 * static_cast<double>(intake.video().used()) / static_cast<double>(intake.video().capacity());
  return format(
      "%s: %u of %u streams, %ju frames, %.0f MiB, %ju lost, %ju gaps, buffer %.0f %%, disk %.1f %% free",
      recording::local_text(wall_ms()).c_str(), streams - silent, streams, std::uintmax_t{frames},
      static_cast<double>(bytes) / kMiB, std::uintmax_t{recorder_.lost()}, std::uintmax_t{gaps}, used,
      recorder_.writer().free_percent());
}

std::string Status::table() const {
  const Clock::time_point now = Clock::now();
  std::string text = format("%-14s %12s %12s %9s %9s %6s %10s %8s %9s %9s\n", "stream", "frames", "expected",
                            "missing", "lost", "gaps", "longest ms", "kbit/s", "motion", "no signal");
  for (unsigned stream = 0; stream < kStreams; ++stream) {
    if (!recorder_.intake().records(stream)) continue;
    const Arrivals &arrivals = recorder_.intake().arrivals(stream);
    const Shortfall::Counts due = counts(stream);
    const std::uintmax_t missing = shortfalls_[stream].missing(due);
    const std::uintmax_t lost = arrivals.lost + recorder_.writer().dropped(stream);
    const double kilobits =
        static_cast<double>(arrivals.bytes) * 8 / 1000 / seconds_of(now - recorder_.start_time());
    text += format("%-14s %12ju %12ju %9ju %9ju %6ju %10ju %8.0f %9ju %9ju\n", stream_name(stream).c_str(),
                   std::uintmax_t{due.frames}, std::uintmax_t{due.expected}, missing, lost,
                   std::uintmax_t{arrivals.gaps}, std::uintmax_t{arrivals.longest_gap_ms}, kilobits,
                   std::uintmax_t{arrivals.motion}, std::uintmax_t{arrivals.no_signal});
  }
  return text;
}

}  // namespace recorder
