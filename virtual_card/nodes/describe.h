/**
 * @file describe.h
 * Writes calls on device nodes as lines for people.
 */
#ifndef VIRTUAL_CARD_DESCRIBE_H
#define VIRTUAL_CARD_DESCRIBE_H

#include <chrono>
#include <span>
#include <string>

#include "device.h"

namespace virtual_card {

/// Returns e.g. "DISP_IOC_READ_REG address=0x310 value=0x5".
std::string describe_command(const CommandRow &row, std::span<const u8> record);
/// Returns e.g. "12.345678 display ioctl DISP_IOC_READ_REG address=0x310 value=0x5 = 0". `time` is card time;
/// `record` is the record after the command.
std::string describe(const Call &call, const CommandRow *row, std::span<const u8> record,
                     std::chrono::nanoseconds time);

}  // namespace virtual_card

#endif
