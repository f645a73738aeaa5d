/**
 * @file commands.h
 * The names of nodes, operations and commands, for the log and for items.
 */
#ifndef VIRTUAL_CARD_COMMANDS_H
#define VIRTUAL_CARD_COMMANDS_H

#include <optional>
#include <string_view>

#include "device.h"

namespace virtual_card {

const char *name_of(Device device);
const char *name_of(Operation operation);
std::optional<Device> device_named(std::string_view name);
std::optional<Operation> operation_named(std::string_view name);
/// Returns the row of a command of a node, or of any node for Device::none; null when there is none.
const CommandRow *command_named(Device device, std::string_view name);
const CommandRow *command_with(Device device, u32 code);

}  // namespace virtual_card

#endif
