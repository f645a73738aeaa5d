// The log of calls on device nodes.
#include "call_log.h"

#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <new>

#include "commands.h"
#include "describe.h"
#include "host/files.h"
#include "host/message.h"
#include "host/real_calls.h"

namespace virtual_card {

CallLog::~CallLog() {
  if (file_ > STDERR_FILENO) real::close(file_);
}

void CallLog::record(bool on) {
  const std::lock_guard lock(mutex_);
  recording_ = on;
  if (on) calls_.clear();
  update();
}

std::vector<Call> CallLog::calls() const {
  const std::lock_guard lock(mutex_);
  return calls_;
}

bool CallLog::write_to(const std::string &path, std::string &error) {
  const std::lock_guard lock(mutex_);
  const long fd = path == "/dev/stderr" ? STDERR_FILENO : create_file(path);
  if (fd < 0) {
    error = fd == -EINVAL ? "not a regular file" : std::strerror(static_cast<int>(-fd));
    return false;
  }
  file_ = static_cast<int>(fd);
  ::fstat(file_, &identity_);
  update();
  return true;
}

void CallLog::listen(std::function<void(const LogLine &line)> listener) {
  const std::lock_guard lock(mutex_);
  listener_ = std::move(listener);
  update();
}

void CallLog::update() {
  on_ = recording_ || file_ >= 0 || listener_;
}

void CallLog::end_file(const char *reason) {
  print_message("the log ends here: %s", reason);
  file_ = -1;
  update();
}

void CallLog::write_line(const std::string &line) {
  struct stat now {};
  const bool same =
      ::fstat(file_, &now) == 0 && now.st_ino == identity_.st_ino && now.st_dev == identity_.st_dev;
  if (!same && file_ != STDERR_FILENO) return end_file("the program has closed its file");
  if (const long error = write_all(file_, line)) end_file(std::strerror(static_cast<int>(-error)));
}

void CallLog::add(Call call, long result, std::chrono::nanoseconds time, const CommandRow *row,
                  std::span<const std::uint8_t> record) noexcept {
  if (!on()) return;
  const bool failed = result < 0 && result >= -kMaxError;
  call.result = failed ? -1 : result;
  call.error = failed ? static_cast<int>(-result) : 0;
  const std::lock_guard lock(mutex_);
  try {
    if (file_ >= 0 || listener_) {
      const bool of_capture_loop = call.operation == Operation::read ||
                                   call.code == driver::ENC_IOC_MPEG4_REQUEST ||
                                   call.code == driver::ENC_IOC_MPEG4_DONE;
      const LogLine line{describe(call, row, record, time), name_of(call.device), of_capture_loop};
      if (file_ >= 0) write_line(line.text);
      if (listener_) listener_(line);
    }
    if (recording_) calls_.push_back(std::move(call));
  } catch (const std::bad_alloc &) {
    // The call has been carried out, whether or not it is in the log.
  }
}

}  // namespace virtual_card
