// The log of calls on device nodes.
#include "call_log.h"

#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <iomanip>
#include <new>
#include <sstream>

#include "host/files.h"
#include "host/real_calls.h"

namespace virtual_card {
namespace {

constexpr const char *kOperations[] = {"open", "close", "ioctl", "read", "mmap", "munmap"};
constexpr const char *kDevices[] = {"encoder", "display", "audio", "video_input", "none"};

std::string line_of(const Call &call, const char *name) {
  std::ostringstream out;
  out << kDevices[static_cast<int>(call.device)] << ' ' << kOperations[static_cast<int>(call.operation)];
  out << std::hex << std::setfill('0');
  if (name != nullptr)
    out << ' ' << name;
  else if (call.operation == Operation::ioctl)
    out << " 0x" << call.code;
  if (!call.argument.empty()) out << ' ';
  for (const std::uint8_t byte : call.argument) out << std::setw(2) << static_cast<unsigned>(byte);
  out << std::dec;
  if (call.size != 0) out << " size " << call.size;
  out << " = " << call.result;
  if (call.error != 0) {
    const char *error = strerrorname_np(call.error);
    out << ' ' << (error != nullptr ? error : std::to_string(call.error));
  }
  out << '\n';
  return out.str();
}

}  // namespace

CallLog::~CallLog() {
  if (file_ > STDERR_FILENO) real::close(file_);
}

void CallLog::record(bool on) {
  const std::lock_guard lock(mutex_);
  recording_ = on;
  if (on) calls_.clear();
  on_ = on || file_ >= 0;
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
  on_ = true;
  return true;
}

void CallLog::end_file(const char *reason) {
  std::fprintf(stderr, "virtual card: the log ends here: %s\n", reason);
  file_ = -1;
  on_ = recording_;
}

void CallLog::write_line(const Call &call, const char *name) {
  struct stat now {};
  const bool same =
      ::fstat(file_, &now) == 0 && now.st_ino == identity_.st_ino && now.st_dev == identity_.st_dev;
  if (!same && file_ != STDERR_FILENO) return end_file("the program has closed its file");
  if (const long error = write_all(file_, line_of(call, name)))
    end_file(std::strerror(static_cast<int>(-error)));
}

void CallLog::add(Call call, long result, const char *name) noexcept {
  if (!on()) return;
  const bool failed = result < 0 && result >= -kMaxError;
  call.result = failed ? -1 : result;
  call.error = failed ? static_cast<int>(-result) : 0;
  const std::lock_guard lock(mutex_);
  try {
    if (file_ >= 0) write_line(call, name);
    if (recording_) calls_.push_back(std::move(call));
  } catch (const std::bad_alloc &) {
    // The call has been carried out, whether or not it is in the log.
  }
}

}  // namespace virtual_card
