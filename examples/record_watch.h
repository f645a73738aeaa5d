/**
 * @file record_watch.h
 * What zarvo_record tells on standard error while it records.
 */
#ifndef RECORD_WATCH_H
#define RECORD_WATCH_H

#include <span>
#include <vector>

#include "record_stream.h"

/// Prints a line when a stream stops or goes on, and on a terminal a progress line once a second.
class Watch {
 public:
  Watch(std::span<const Stream> streams, Clock::time_point start);
  /// Clears the progress line.
  ~Watch();
  Watch(const Watch &) = delete;
  Watch &operator=(const Watch &) = delete;

  /// Call it several times a second.
  void look();

 private:
  void tell_stopped(Clock::time_point now);
  void show_progress(Clock::time_point now);
  void clear_progress() const;

  std::span<const Stream> streams_;
  std::vector<bool> stopped_;  ///< for each stream, whether a line has reported it
  bool terminal_;
  Clock::time_point start_, shown_;
  std::uint64_t frames_ = 0, bytes_ = 0;  ///< the sums that the last progress line has counted
};

#endif
