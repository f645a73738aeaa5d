/**
 * @file messages.h
 * Lines for standard error, from the writer to the main thread: a terminal or pipe that does not take them
 * must not hold the writer up.
 */
#ifndef RECORDER_MESSAGES_H
#define RECORDER_MESSAGES_H

#include <cstdint>
#include <mutex>
#include <string>
#include <vector>

#include "frame.h"

namespace recorder {

class Messages {
 public:
  /// Any thread. The line begins with the time of what it tells. Keeps at most kMost lines until they are
  /// printed, and drops the others.
  void add(const std::string &line, std::int64_t time = wall_ms());

  void print();

 private:
  static constexpr std::size_t kMost = 1000;
  std::mutex mutex_;  ///< guards lines_
  std::vector<std::string> lines_;
};

}  // namespace recorder

#endif
