/**
 * @file call_log.h
 * The log of calls on device nodes.
 */
#ifndef VIRTUAL_CARD_CALL_LOG_H
#define VIRTUAL_CARD_CALL_LOG_H

#include <atomic>
#include <fstream>
#include <mutex>

#include "virtual_card.h"

namespace virtual_card {

/// The calls on device nodes in the order of their completion: in memory for tests, in a file for people.
class CallLog {
 public:
  void record(bool on);
  std::vector<Call> calls() const;
  /// Also writes a line to this file for each call from now on. Returns false when the file cannot be
  /// written.
  bool write_to(const std::string &path);
  /// Returns whether add() records calls.
  bool on() const { return on_.load(std::memory_order_relaxed); }
  /// Adds a call. `name` is the name of the ioctl code, or null.
  void add(Call call, const char *name = nullptr);

 private:
  std::atomic<bool> on_{false};  // recording_ or file_ is open; read without the lock on the frame path
  mutable std::mutex mutex_;     // guards all members below
  bool recording_ = false;
  std::vector<Call> calls_;
  std::ofstream file_;
};

}  // namespace virtual_card

#endif
