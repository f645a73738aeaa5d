/**
 * @file command.h
 * How the SDK talks to the driver: one way to issue a command, and the register accesses made of it.
 */
#ifndef ZV_COMMAND_H
#define ZV_COMMAND_H

#include <sys/ioctl.h>

#include <type_traits>

#include "zv_card.h"
#include "zv_driver.h"

namespace zarvo {

/// A command without an argument.
inline int issue(i32 fd, u32 code) {
  return ioctl(fd, code);
}

/// A command whose argument is the number 0 itself.
inline int issue_with_zero(i32 fd, u32 code) {
  return ioctl(fd, code, 0L);
}

/// A command on a record, which may be a temporary when the driver's answer is of no interest.
template <typename Record>
int issue(i32 fd, u32 code, Record &&record) {
  static_assert(!std::is_const_v<std::remove_reference_t<Record>>, "the driver may write into a record");
  static_assert(std::is_trivially_copyable_v<std::remove_reference_t<Record>> &&
                !std::is_pointer_v<std::remove_reference_t<Record>> &&
                !std::is_null_pointer_v<std::remove_reference_t<Record>>);
  return ioctl(fd, code, &record);
}

/// A command that only returns a word. `word` is what the answer is when the driver gives none.
inline u32 ask(i32 fd, u32 code, u32 word = 0) {
  issue(fd, code, word);
  return word;
}

inline u32 read_register(i32 fd, u32 code, u32 address) {
  driver::Register access{address, 0};
  issue(fd, code, access);
  return access.value;
}

// Codec-chip registers.
inline u32 read_codec(const ZV_CARD &card, u32 address) {
  return read_register(card.disp_fd, driver::DISP_IOC_READ_REG, address);
}
inline void write_codec(const ZV_CARD &card, u32 address, u32 value) {
  issue(card.disp_fd, driver::DISP_IOC_WRITE_REG, driver::Register{address, value});
}

// Video-input registers.
inline u32 read_video_input(const ZV_CARD &card, u32 address) {
  return read_register(card.vin_fd, driver::VIN_IOC_READ_REG, address);
}
inline void write_video_input(const ZV_CARD &card, u32 address, u32 value) {
  issue(card.vin_fd, driver::VIN_IOC_WRITE_REG, driver::Register{address, value});
}

// TW2815 registers.
inline u8 read_decoder(const ZV_CARD &card, u8 chip, u8 address) {
  driver::DecoderRegister access{chip, address, 0};
  issue(card.vin_fd, driver::VIN_IOC_READ_TW2815, access);
  return access.value;
}
inline void write_decoder(const ZV_CARD &card, u8 chip, u8 address, u8 value) {
  issue(card.vin_fd, driver::VIN_IOC_WRITE_TW2815, driver::DecoderRegister{chip, address, value});
}

/// Sends a command to the board controller and returns its reply; `untouched` when there is none.
inline u32 board_command(const ZV_CARD &card, u32 command, u32 untouched) {
  driver::BoardCommand exchange{command, untouched};
  issue(card.vin_fd, driver::VIN_IOC_BOARD_CMD, exchange);
  return exchange.reply;
}

}  // namespace zarvo

#endif
