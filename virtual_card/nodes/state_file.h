/**
 * @file state_file.h
 * The state that a card keeps until power-off, in a text file: the driver commands that lead to it from
 * power-up, one a line, and a checksum. To load the file is to carry out its commands.
 */
#ifndef VIRTUAL_CARD_STATE_FILE_H
#define VIRTUAL_CARD_STATE_FILE_H

#include <memory>
#include <span>
#include <string>

#include "device.h"

namespace virtual_card {

/// The nodes in the order of Device.
using Nodes = std::span<const std::unique_ptr<DeviceNode>>;

/// Brings a card at power-up into the state of a file. A file that does not exist changes nothing. Returns an
/// empty text, or what is wrong; then the card may be in a part of the state.
std::string load_state(const std::string &path, Nodes nodes);
/// Replaces the file by the state of the board. Returns an empty text, or why the file is as it was.
std::string save_state(const std::string &path, Board &board);

}  // namespace virtual_card

#endif
