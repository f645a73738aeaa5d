// Takes frames from the buffer to the files, in large writes.
#include "writer.h"

#include <pthread.h>
#include <signal.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <set>

#include "recording/tree.h"

namespace recorder {
namespace {

/// The time between two passes. A kill loses frames of at most this time. The longer it is, the more frames a
/// write takes, and a write costs more than what it writes.
constexpr auto kPeriod = std::chrono::milliseconds(48);
constexpr auto kRetry = std::chrono::seconds(10);
constexpr auto kCheck = std::chrono::seconds(1);

std::string name_of(const Hour &hour) {
  return recording::hour_name(hour.local);
}

}  // namespace

Writer::Writer(const Options &options, RootLock &lock, Intake &intake, Messages &messages)
    : options_(options), lock_(lock), intake_(intake), messages_(messages) {
  for (unsigned stream = 0; stream < kStreams; ++stream) {
    if (!intake.records(stream)) continue;
    outputs_.push_back(std::make_unique<Output>(options, lock, stream));
    by_stream_[stream] = outputs_.back().get();
  }
}

void Writer::start() {
  // The files take turns, so that the writer never waits long for the disk.
  const auto now = Clock::now();
  const Clock::duration turn =
      options_.sync / static_cast<Clock::rep>(std::max<std::size_t>(1, outputs_.size()));
  for (std::size_t n = 0; n < outputs_.size(); ++n)
    outputs_[n]->next_sync = now + turn * static_cast<Clock::rep>(n + 1);
  // Signals are for the main thread.
  sigset_t all, before;
  sigfillset(&all);
  pthread_sigmask(SIG_SETMASK, &all, &before);
  thread_ = std::thread([this] { run(); });
  pthread_sigmask(SIG_SETMASK, &before, nullptr);
}

void Writer::note_end() {
  end_ = Clock::now();
  end_wall_ = wall_ms();
}

void Writer::finish() {
  ending_ = true;
  if (thread_.joinable()) thread_.join();
}

void Writer::run() {
  pthread_setname_np(pthread_self(), "writer");
  for (Clock::time_point next = Clock::now(); !ending_; next = std::max(next + kPeriod, Clock::now())) {
    std::this_thread::sleep_until(next);
    pass(Clock::now());
  }
  for (auto &output : outputs_) output->next_try = {};  // the last try
  full_ = false;
  next_check_ = Clock::time_point::max();  // the last frames may take what must stay free
  pass(Clock::now());
  end_files();
}

void Writer::pass(Clock::time_point now) {
  if (now >= next_check_) {
    next_check_ = now + kCheck;
    check_space(now);
    for (auto &output : outputs_) {
      if (const int error = output->files.check_place()) report_error(*output, error);
      tell_index_error(*output);
    }
  }
  take_frames(intake_.video());
  take_frames(intake_.audio());
  for (auto &output : outputs_) write(*output, now);
  make_room(intake_.video(), true);
  make_room(intake_.audio(), false);
  for (auto &output : outputs_) {
    dropped_[output->stream] = output->files.dropped();
    if (now >= output->next_sync) sync(*output, now);
  }
}

void Writer::take_frames(Ring &ring) {
  for (Ring::Taken taken = ring.take(); taken.frame != nullptr; taken = ring.take()) {
    const Frame &frame = *taken.frame;
    if (frame.gap_ms > 0) tell_gap(frame.stream, frame.gap_ms, frame.time);
    if (frame.lost > 0) tell_loss(frame.stream, frame.lost, frame.time);
    by_stream_[frame.stream]->files.queue(taken);
  }
}

void Writer::tell_loss(unsigned stream, std::uint32_t lost, std::int64_t time) {
  messages_.add(stream_name(stream) + ": the buffer was full: " + std::to_string(lost) +
                    (is_video(stream) ? " frames" : " blocks") + " are lost",
                time);
}

void Writer::tell_gap(unsigned stream, std::uint32_t gap_ms, std::int64_t time) {
  char text[64];
  std::snprintf(text, sizeof text, ": gap of %.2f s", gap_ms / 1000.0);
  messages_.add(stream_name(stream) + text, time);
}

void Writer::write(Output &output, Clock::time_point now) {
  if (full_ || now < output.next_try) return;
  const int error = output.files.write();
  if (error != 0) {
    report_error(output, error);
    output.next_try = now + kRetry;
  } else if (output.error != 0 && output.files.in_place()) {
    messages_.add(stream_name(output.stream) + ": goes on in " + output.files.path());
    output.error = 0;
  }
  if (error == 0) tell_dropped(output);
}

void Writer::tell_dropped(Output &output) {
  const std::uint64_t lost = output.files.dropped() - output.told;
  if (lost == 0) return;
  messages_.add(stream_name(output.stream) + ": " + std::to_string(lost) +
                " could not be written and are lost");
  output.told += lost;
}

/// Says the same only once.
void Writer::report_error(Output &output, int error) {
  if (error == output.error) return;
  output.error = error;
  output.files.note_disk_error(wall_ms(), error);
  messages_.add(stream_name(output.stream) + ": " + output.files.path() + ": " + error_text(error));
}

/// Frames that cannot be written wait in the buffer for the next try, but only in its newer half: the other
/// half is for the streams that can be written. Then gives the space of all frames back that are written or
/// dropped.
void Writer::make_room(Ring &ring, bool video) {
  const std::uint64_t taken = ring.taken();
  const std::uint64_t half = ring.capacity() / 2;
  std::uint64_t oldest = taken;
  for (auto &output : outputs_) {
    if (is_video(output->stream) != video || output->files.all_written()) continue;
    const bool held = full_ || output->error != 0;
    if (held && taken > half) output->files.drop_until(taken - half);
    if (!output->files.all_written()) oldest = std::min(oldest, output->files.oldest());
  }
  ring.release(oldest);
}

void Writer::sync(Output &output, Clock::time_point now) {
  output.next_sync = now + options_.sync;
  report_unsynced(output, output.files.sync(), now);
}

/// Only an error of the open file makes the stream pause: the others have ended.
void Writer::report_unsynced(Output &output, const std::vector<Unsynced> &files, Clock::time_point now) {
  for (const Unsynced &file : files) {
    messages_.add(stream_name(output.stream) + ": " + file.path + ": " + error_text(file.error) + ": up to " +
                  std::to_string(options_.sync.count()) + " s may be lost");
    if (!file.is_open) continue;
    output.error = file.error;
    output.files.note_disk_error(wall_ms(), file.error);
    output.next_try = now + kRetry;
  }
}

void Writer::tell_index_error(Output &output) {
  if (const int error = output.files.take_index_error())
    messages_.add(stream_name(output.stream) + ": index: " + error_text(error) + ": lines may be missing");
}

void Writer::check_space(Clock::time_point now) {
  free_ = recorder::free_percent(options_.root).value_or(-1);
  if (free_ < 0) return;  // the root is away
  const bool low = free_ < options_.min_free;
  const bool full = low && !(options_.delete_oldest && make_space(now));
  if (full == full_) return;
  full_ = full;
  if (full)
    for (auto &output : outputs_) output->files.note_disk_error(wall_ms(), ENOSPC);
  char text[128];
  std::snprintf(text, sizeof text, "%s: %.1f %% of the disk is free, --min-free is %.0f",
                full ? "recording pauses" : "recording goes on", free_.load(), options_.min_free);
  messages_.add(text);
}

/// Deletes the recordings of an hour, unless an earlier deletion can still free space. Returns false if there
/// is none that may be deleted.
bool Writer::make_space(Clock::time_point now) {
  if (!pause_.is_over(now, free_)) return true;
  if (lock_.hold() != 0) return false;
  const std::string hour = delete_hour(now);
  if (hour.empty()) return false;
  pause_ = {now + kRetry, free_};
  free_ = recorder::free_percent(options_.root).value_or(free_);
  messages_.add("deleted the recordings of hour " + hour + " to make room");
  return true;
}

/// Deletes the oldest hour and returns it. An hour of an open file goes last: a file keeps the rest of its
/// group when the hour changes, unless there is no other space.
std::string Writer::delete_hour(Clock::time_point now) {
  const std::string current = name_of(hour_of(wall_ms()));
  std::set<std::string> kept{current};
  for (const auto &output : outputs_)
    if (output->files.is_open()) kept.insert(name_of(output->files.hour()));
  std::string hour = delete_oldest_hour(options_.root, kept);
  if (!hour.empty() || kept.size() == 1) return hour;
  for (auto &output : outputs_) {
    if (!output->files.is_open() || name_of(output->files.hour()) == current) continue;
    output->files.end_file();
    sync(*output, now);  // closes it: a file that is open keeps its space
  }
  return delete_oldest_hour(options_.root, {current});
}

void Writer::end_files() {
  for (auto &output : outputs_) {
    output->files.drop_until(~std::uint64_t{0});
    dropped_[output->stream] = output->files.dropped();
    tell_dropped(*output);
    const std::uint32_t silence_ms = intake_.silence_ms(output->stream, end_);
    if (silence_ms > 0) tell_gap(output->stream, silence_ms, end_wall_);
    const std::uint32_t lost = intake_.last_loss(output->stream);
    if (lost > 0) tell_loss(output->stream, lost, wall_ms());
    report_unsynced(*output, output->files.finish(end_wall_, silence_ms, lost), {});
    tell_index_error(*output);
  }
}

}  // namespace recorder
