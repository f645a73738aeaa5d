// The log of calls on device nodes.
#include "call_log.h"

#include <iomanip>

namespace virtual_card {
namespace {

constexpr const char *kOperations[] = {"open", "close", "ioctl", "read", "mmap", "munmap"};
constexpr const char *kDevices[] = {"encoder", "display", "audio", "video_input", "none"};

void write_line(std::ostream &out, const Call &call, const char *name) {
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
  out << " = " << call.result << '\n' << std::flush;
}

}  // namespace

void CallLog::record(bool on) {
  const std::lock_guard lock(mutex_);
  recording_ = on;
  if (on) calls_.clear();
  on_ = on || file_.is_open();
}

std::vector<Call> CallLog::calls() const {
  const std::lock_guard lock(mutex_);
  return calls_;
}

bool CallLog::write_to(const std::string &path) {
  const std::lock_guard lock(mutex_);
  file_.open(path);
  on_ = recording_ || file_.is_open();
  return file_.is_open();
}

void CallLog::add(Call call, const char *name) {
  if (!on()) return;
  const std::lock_guard lock(mutex_);
  if (file_.is_open()) write_line(file_, call, name);
  if (recording_) calls_.push_back(std::move(call));
}

}  // namespace virtual_card
