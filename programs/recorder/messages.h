/**
 * @file messages.h
 * Lines for standard error, from the writer to the main thread: a terminal or pipe that does not take them
 * must not hold the writer up.
 */
#ifndef RECORDER_MESSAGES_H
#define RECORDER_MESSAGES_H

#include <cstdint>
#include <deque>
#include <mutex>
#include <string>
#include <string_view>

#include "frame.h"

namespace recorder {

/// Writes a text to a descriptor. If the reader takes nothing for a moment, leaves out the rest and returns
/// false.
bool print_in_time(int file, std::string_view text);

class Messages {
 public:
  /// Any thread. The line begins with the time of what it tells. Keeps at most kMost lines until they are
  /// printed, and drops the others.
  void add(const std::string &line, std::int64_t time = wall_ms());

  /// Prints the lines to standard error. Lines that its reader does not take in time stay for the next call.
  /// Only one thread may call it.
  void print();

 private:
  static constexpr std::size_t kMost = 1000;
  std::mutex mutex_;  ///< guards lines_
  std::deque<std::string> lines_;
};

}  // namespace recorder

#endif
