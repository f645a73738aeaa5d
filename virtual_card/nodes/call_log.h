#ifndef VIRTUAL_CARD_CALL_LOG_H
#define VIRTUAL_CARD_CALL_LOG_H

#include <atomic>
#include <fstream>
#include <mutex>

#include "virtual_card.h"

namespace virtual_card {

/// What was done to the device nodes, in order of completion: kept for tests, written to a file for
/// people.
class CallLog {
 public:
  void record(bool on);
  std::vector<Call> calls() const;
  /// Every command from now on also becomes a line of this file. False when it cannot be written.
  bool write_to(const std::string &path);
  /// Whether add() does anything.
  bool on() const { return on_.load(std::memory_order_relaxed); }
  /// `name` is that of the ioctl code, or null.
  void add(Call call, const char *name = nullptr);

 private:
  std::atomic<bool> on_{false};  // recording_ or a file: keeps the lock off the frame path
  mutable std::mutex mutex_;     // guards everything below
  bool recording_ = false;
  std::vector<Call> calls_;
  std::ofstream file_;
};

}  // namespace virtual_card

#endif
