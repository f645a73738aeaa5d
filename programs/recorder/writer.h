/**
 * @file writer.h
 * The thread that takes frames from the buffer to the files.
 */
#ifndef RECORDER_WRITER_H
#define RECORDER_WRITER_H

#include <array>
#include <atomic>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "disk_space.h"
#include "intake.h"
#include "messages.h"
#include "options.h"
#include "stream_files.h"

namespace recorder {

class Writer {
 public:
  Writer(const Options &options, RootLock &lock, Intake &intake, Messages &messages);
  ~Writer() { finish(); }
  Writer(const Writer &) = delete;
  Writer &operator=(const Writer &) = delete;

  void start();
  /// The recording ends now: silence from here on is no gap.
  void note_end();
  /// Writes all that is in the buffer, ends the files and joins the thread. Call it when no callback runs any
  /// more.
  void finish();

  /// Any thread: frames that were dropped because their files could not be written.
  std::uint64_t dropped(unsigned stream) const { return dropped_[stream]; }
  /// Any thread: how much of the disk was free lately, in percent; negative if that is not known.
  double free_percent() const { return free_; }

 private:
  /// A stream that is recorded.
  struct Output {
    Output(const Options &options, RootLock &lock, unsigned number)
        : stream(number), files(options, lock, number) {}

    unsigned stream;
    StreamFiles files;
    Clock::time_point next_sync;
    int error = 0;               ///< of the last write, or 0
    Clock::time_point next_try;  ///< after an error
    std::uint64_t told = 0;      ///< how many dropped frames a line has told
  };

  void run();
  void pass(Clock::time_point now);
  void take_frames(Ring &ring);
  void write(Output &output, Clock::time_point now);
  void tell_dropped(Output &output);
  void make_room(Ring &ring, bool video);
  void sync(Output &output, Clock::time_point now);
  void report_error(Output &output, int error);
  void report_unsynced(Output &output, const std::vector<Unsynced> &files, Clock::time_point now);
  void tell_index_error(Output &output);
  void tell_loss(unsigned stream, std::uint32_t lost, std::int64_t time);
  void tell_gap(unsigned stream, std::uint32_t gap_ms, std::int64_t time);
  void check_space(Clock::time_point now);
  bool make_space(Clock::time_point now);
  std::string delete_hour(Clock::time_point now);
  void end_files();

  const Options &options_;
  RootLock &lock_;
  Intake &intake_;
  Messages &messages_;
  std::vector<std::unique_ptr<Output>> outputs_;
  std::array<Output *, kStreams> by_stream_{};
  Clock::time_point next_check_;
  bool full_ = false;  ///< less is free than must stay free
  DeletionPause pause_;
  Clock::time_point end_;  ///< of the recording
  std::int64_t end_wall_ = 0;
  std::array<std::atomic<std::uint64_t>, kStreams> dropped_{};
  std::atomic<double> free_{-1};
  std::atomic<bool> ending_{false};
  std::thread thread_;
};

}  // namespace recorder

#endif
