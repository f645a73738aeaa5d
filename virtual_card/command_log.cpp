#include "command_log.h"

#include <iomanip>

namespace virtual_card {
namespace {

constexpr const char *kOperations[] = {"open", "close", "ioctl", "read", "mmap", "munmap"};
constexpr const char *kDevices[] = {"encoder", "display", "audio", "video_input", "none"};

void write_line(std::ostream &out, const Command &command, const char *name) {
  out << kDevices[static_cast<int>(command.device)] << ' '
      << kOperations[static_cast<int>(command.operation)];
  out << std::hex << std::setfill('0');
  if (name != nullptr)
    out << ' ' << name;
  else if (command.operation == Operation::ioctl)
    out << " 0x" << command.code;
  if (!command.argument.empty()) out << ' ';
  for (const std::uint8_t byte : command.argument) out << std::setw(2) << static_cast<unsigned>(byte);
  out << std::dec;
  if (command.size != 0) out << " size " << command.size;
  out << " = " << command.result << '\n' << std::flush;
}

}  // namespace

void CommandLog::record(bool on) {
  const std::lock_guard lock(mutex_);
  recording_ = on;
  if (on) commands_.clear();
  on_ = on || file_.is_open();
}

std::vector<Command> CommandLog::commands() const {
  const std::lock_guard lock(mutex_);
  return commands_;
}

bool CommandLog::write_to(const std::string &path) {
  const std::lock_guard lock(mutex_);
  file_.open(path);
  on_ = recording_ || file_.is_open();
  return file_.is_open();
}

void CommandLog::add(Command command, const char *name) {
  if (!on()) return;
  const std::lock_guard lock(mutex_);
  if (file_.is_open()) write_line(file_, command, name);
  if (recording_) commands_.push_back(std::move(command));
}

}  // namespace virtual_card
