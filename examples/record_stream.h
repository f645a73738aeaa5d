/**
 * @file record_stream.h
 * A stream that zarvo_record writes: its file, and the tally of what has come.
 */
#ifndef RECORD_STREAM_H
#define RECORD_STREAM_H

#include <atomic>
#include <chrono>
#include <cstdint>
#include <string>

#include "zv_type.h"

using Clock = std::chrono::steady_clock;

/// What a stream consists of.
struct StreamKind {
  const char *unit;  ///< "frames" or "blocks"
  double rate;       ///< how many come in a second
  bool is_video;
};

/// An SDK thread calls append(), the main thread everything else. While capture runs, the main thread may
/// read frames(), bytes(), missing(), incomplete() and silence().
class Stream {
 public:
  /// Says that this stream is recorded. `name` is the path of its file.
  void choose(const std::string &name, const StreamKind &kind);
  bool is_chosen() const { return !name_.empty(); }
  const std::string &name() const { return name_; }
  bool is_video() const { return kind_.is_video; }
  /// Creates the file. Does not follow a symbolic link in its place. Throws std::runtime_error.
  void create(bool overwrite);
  /// Writes to an open descriptor instead.
  void take(int file);

  /// Counts gaps from now on.
  void begin(Clock::time_point now);
  /// Counts a frame and writes it at once. Returns 0 or the errno of a write that failed. While the reader of
  /// a pipe does not read, waits until `stopping` is set, and then leaves out the rest of the frame.
  int append(const u8 *data, i32 length, i32 flags, const std::atomic<bool> &stopping);
  /// Counts the time since the last frame as a gap and closes the file. Returns 0 or the errno of the close.
  int end(Clock::time_point now);

  std::uint64_t frames() const { return frames_; }
  std::uint64_t bytes() const { return bytes_; }
  /// Returns the time since the last frame, or since begin() if there is none.
  Clock::duration silence(Clock::time_point now) const { return now - last_.load(); }

  /// expected() returns how many frames are due `seconds` after begin(), missing() how many of them have not
  /// come.
  std::uint64_t expected(double seconds) const;
  std::uint64_t missing(double seconds) const;
  /// Returns whether more than 1 % is missing. Two missing frames never count: the
  /// first and the last may be on their way.
  bool incomplete(double seconds) const;

  /// Prints the whole tally as a line.
  void report(double seconds) const;

 private:
  static constexpr std::uint64_t kOnTheirWay = 2;
  void note_gap(Clock::time_point now);

  StreamKind kind_{};
  std::string name_;
  int file_ = -1;
  std::size_t piece_ = 0;  ///< the most bytes of one write
  std::atomic<std::uint64_t> frames_{0}, bytes_{0};
  std::atomic<Clock::time_point> last_{};  ///< when the last frame came
  Clock::duration longest_gap_{};
  std::uint64_t motion_ = 0, lost_signal_ = 0;
};

#endif
