/**
 * @file messages.h
 * Lines for standard error, from the writer to the main thread: a terminal or pipe that does not take them
 * must not hold the writer up.
 */
#ifndef RECORDER_MESSAGES_H
#define RECORDER_MESSAGES_H

#include <cstdio>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

namespace recorder {

class Messages {
 public:
  /// Any thread. Keeps at most kMost lines until they are printed, and drops the others.
  void add(std::string line) {
    const std::lock_guard lock(mutex_);
    if (lines_.size() < kMost) lines_.push_back(std::move(line));
  }

  void print() {
    std::vector<std::string> lines;
    {
      const std::lock_guard lock(mutex_);
      lines.swap(lines_);
    }
    for (const std::string &line : lines) std::fprintf(stderr, "zarvo_recorder: %s\n", line.c_str());
  }

 private:
  static constexpr std::size_t kMost = 1000;
  std::mutex mutex_;  ///< guards lines_
  std::vector<std::string> lines_;
};

}  // namespace recorder

#endif
