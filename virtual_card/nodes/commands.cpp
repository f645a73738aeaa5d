// The names of nodes, operations and commands.
#include "commands.h"

#include <algorithm>
#include <array>

#include "device_display.h"
#include "device_encoder.h"
#include "device_video_input.h"

namespace virtual_card {
namespace {

constexpr std::array<const char *, 5> kDevices{"encoder", "display", "audio", "video_input", "none"};
constexpr std::array<const char *, 6> kOperations{"open", "close", "ioctl", "read", "mmap", "munmap"};

template <typename Name, std::size_t Count>
std::optional<Name> named(const std::array<const char *, Count> &names, std::string_view name) {
  const auto found = std::find(names.begin(), names.end(), name);
  if (found == names.end()) return {};
  return static_cast<Name>(found - names.begin());
}

std::span<const CommandRow> commands_of(Device device) {
  switch (device) {
    case Device::encoder:
      return EncoderDevice::table();
    case Device::display:
      return DisplayDevice::table();
    case Device::video_input:
      return VideoInputDevice::table();
    default:
      return {};
  }
}

template <typename Matches>
const CommandRow *find_command(Device device, Matches matches) {
  for (const Device each : {Device::encoder, Device::display, Device::video_input}) {
    if (device != Device::none && device != each) continue;
    const auto rows = commands_of(each);
    const auto found = std::find_if(rows.begin(), rows.end(), matches);
    if (found != rows.end()) return &*found;
  }
  return nullptr;
}

}  // namespace

const char *name_of(Device device) {
  return kDevices[static_cast<std::size_t>(device)];
}

const char *name_of(Operation operation) {
  return kOperations[static_cast<std::size_t>(operation)];
}

std::optional<Device> device_named(std::string_view name) {
  const auto device = named<Device>(kDevices, name);
  return device == Device::none ? std::nullopt : device;
}

std::optional<Operation> operation_named(std::string_view name) {
  return named<Operation>(kOperations, name);
}

const CommandRow *command_named(Device device, std::string_view name) {
  return find_command(device, [&](const CommandRow &row) { return row.name == name; });
}

const CommandRow *command_with(Device device, u32 code) {
  return find_command(device, [&](const CommandRow &row) { return row.code == code; });
}

}  // namespace virtual_card
