/**
 * @file call_log.h
 * The log of calls on device nodes.
 */
#ifndef VIRTUAL_CARD_CALL_LOG_H
#define VIRTUAL_CARD_CALL_LOG_H

#include <sys/stat.h>

#include <atomic>
#include <mutex>

#include "virtual_card.h"

namespace virtual_card {

/// A result from -kMaxError to -1 is a negated error number.
inline constexpr long kMaxError = 4095;

/// The calls on device nodes in the order of their completion: in memory for tests, in a file for people.
class CallLog {
 public:
  ~CallLog();
  void record(bool on);
  std::vector<Call> calls() const;
  /// Also writes a line to this file for each call from now on; "/dev/stderr" is the host's standard error.
  /// Returns false, with the reason in `error`, when the file cannot be written or is no regular file.
  bool write_to(const std::string &path, std::string &error);
  /// Returns whether add() records calls.
  bool on() const { return on_.load(std::memory_order_relaxed); }
  /// Adds a call that ended with `result`. `name` is the name of the ioctl code, or null. A call for which
  /// memory runs out is missing in the log.
  void add(Call call, long result, const char *name = nullptr) noexcept;

 private:
  void write_line(const Call &call, const char *name);
  void end_file(const char *reason);

  std::atomic<bool> on_{false};  // recording_ or file_ is open; read without the lock on the frame path
  mutable std::mutex mutex_;     // guards all members below
  bool recording_ = false;
  std::vector<Call> calls_;
  int file_ = -1;
  struct stat identity_ {};  // of the file, to notice when the host has closed it and reused its number
};

}  // namespace virtual_card

#endif
