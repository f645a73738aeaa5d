// Runs commands: copies the record in, calls the handler, copies the reply out.
#include "device.h"

#include <cerrno>
#include <cstring>

#include "commands.h"
#include "host/user_memory.h"

namespace virtual_card {
namespace {

bool channel_fits(const CommandRow &row, const void *record) {
  u32 channel = 0;
  if (row.channel_first) std::memcpy(&channel, record, sizeof channel);
  return channel < kChannels;
}

}  // namespace

long DeviceNode::ioctl(u32 code, std::uintptr_t argument) {
  const CommandRow *const row = command_with(device_, code);
  alignas(std::max_align_t) std::array<u8, kMaxRecord> record;
  if (!board_.log.on()) return run(code, row, argument, record, nullptr);

  Call logged{Operation::ioctl, device_};
  logged.code = code;
  logged.value = argument;
  const long result = run(code, row, argument, record, &logged);
  // A record that never came in has no fields to show.
  const std::size_t size = logged.argument.empty() ? 0 : row->size;
  board_.log.add(std::move(logged), result, board_.clock.now(), row, std::span(record).first(size));
  return result;
}

long DeviceNode::execute(const CommandRow &row, void *record) {
  if (!channel_fits(row, record)) return -EINVAL;
  const std::lock_guard lock(board_.mutex);
  return row.handler(*this, record);
}

long DeviceNode::run(u32 code, const CommandRow *row, std::uintptr_t argument, std::span<u8> record,
                     Call *logged) {
  if (const int error = board_.call_faults.strike(Operation::ioctl, device_, code)) return -error;
  if (row == nullptr) return -ENOTTY;

  if (row->size > 0) {
    if (const long error = copy_from_user(record.data(), argument, row->size)) return error;
    if (logged != nullptr) {
      logged->argument.assign(record.begin(), record.begin() + static_cast<std::ptrdiff_t>(row->size));
      log_pointed_to(row->code, record.data(), logged->argument);
    }
  }
  if (!channel_fits(*row, record.data())) return -EINVAL;
  // Test whether the reply can be written back before the command changes anything.
  if (row->answers)
    if (const long error = copy_to_user(argument, record.data(), row->size)) return error;
  if (const long error = execute(*row, record.data())) return error;
  return row->answers ? copy_to_user(argument, record.data(), row->size) : 0;
}

long DeviceNode::read(std::uintptr_t, std::size_t) {
  return -EINVAL;
}

long DeviceNode::place_mapping(std::size_t, int, off_t) {
  return -ENODEV;
}

}  // namespace virtual_card
