/**
 * @file call_log.h
 * The log of calls on device nodes.
 */
#ifndef VIRTUAL_CARD_CALL_LOG_H
#define VIRTUAL_CARD_CALL_LOG_H

#include <sys/stat.h>

#include <atomic>
#include <chrono>
#include <functional>
#include <mutex>
#include <span>

#include "virtual_card.h"

namespace virtual_card {

struct CommandRow;

/// A result from -kMaxError to -1 is a negated error number.
inline constexpr long kMaxError = 4095;

/// A call as a line for people.
struct LogLine {
  std::string text;
  const char *node;
  bool of_capture_loop;  ///< a read, or the request or release of a frame
};

/// The calls on device nodes in the order of their completion: in memory for tests, in a file and at the
/// control socket for people.
class CallLog {
 public:
  ~CallLog();
  void record(bool on);
  std::vector<Call> calls() const;
  /// Also writes a line to this file for each call from now on; "/dev/stderr" is the host's standard error.
  /// Returns false, with the reason in `error`, when the file cannot be written or is no regular file.
  bool write_to(const std::string &path, std::string &error);
  /// Also calls `listener` for each call from now on; an empty function ends that.
  void listen(std::function<void(const LogLine &line)> listener);
  /// Returns whether add() records calls.
  bool on() const { return on_.load(std::memory_order_relaxed); }
  /// Adds a call that ended with `result` at the card time `time`. `row` is the row of its command, or null;
  /// `record` its record after it has run. A call for which memory runs out is missing in the log.
  void add(Call call, long result, std::chrono::nanoseconds time, const CommandRow *row = nullptr,
           std::span<const std::uint8_t> record = {}) noexcept;

 private:
  void update();
  void write_line(const std::string &line);
  void end_file(const char *reason);

  std::atomic<bool> on_{false};  // somebody wants the calls; read without the lock on the frame path
  mutable std::mutex mutex_;     // guards all members below
  bool recording_ = false;
  std::vector<Call> calls_;
  int file_ = -1;
  struct stat identity_ {};  // of the file, to notice when the host has closed it and reused its number
  std::function<void(const LogLine &line)> listener_;
};

}  // namespace virtual_card

#endif
