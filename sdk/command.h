/**
 * @file command.h
 * The functions through which the SDK issues commands to the driver, and the register accesses built on
 * them.
 */
#ifndef ZV_COMMAND_H
#define ZV_COMMAND_H

#include <sys/ioctl.h>

#include <cerrno>
#include <type_traits>

#include "zv_card.h"
#include "zv_driver.h"

namespace zarvo {

/// Makes a system call again for as long as a signal interrupts it.
template <typename Call>
auto uninterrupted(Call call) {
  auto result = call();
  while (result == -1 && errno == EINTR) result = call();
  return result;
}

/// Issues a command without an argument.
inline int issue(i32 fd, u32 code) {
  return uninterrupted([=] { return ioctl(fd, code); });
}

/// Issues a command whose third argument is the number 0, not an address.
inline int issue_with_zero(i32 fd, u32 code) {
  return uninterrupted([=] { return ioctl(fd, code, 0L); });
}

/// Issues a command on a record. The record may be a temporary if the caller does not need the reply.
template <typename Record>
int issue(i32 fd, u32 code, Record &&record) {
  static_assert(!std::is_const_v<std::remove_reference_t<Record>>, "the driver may write into a record");
  static_assert(std::is_trivially_copyable_v<std::remove_reference_t<Record>> &&
                !std::is_pointer_v<std::remove_reference_t<Record>> &&
                !std::is_null_pointer_v<std::remove_reference_t<Record>>);
  return uninterrupted([&] { return ioctl(fd, code, &record); });
}

/// Issues a command that returns a word. Returns the word the driver writes, or `word` if it writes none.
inline u32 ask(i32 fd, u32 code, u32 word = 0) {
  issue(fd, code, word);
  return word;
}

inline u32 read_register(i32 fd, u32 code, u32 address) {
  driver::Register access{address, 0};
  issue(fd, code, access);
  return access.value;
}

// Access to codec-chip registers.
inline u32 read_codec(const ZV_CARD &card, u32 address) {
  return read_register(card.disp_fd, driver::DISP_IOC_READ_REG, address);
}
inline void write_codec(const ZV_CARD &card, u32 address, u32 value) {
  issue(card.disp_fd, driver::DISP_IOC_WRITE_REG, driver::Register{address, value});
}

// Access to video-input registers.
inline u32 read_video_input(const ZV_CARD &card, u32 address) {
  return read_register(card.vin_fd, driver::VIN_IOC_READ_REG, address);
}
inline void write_video_input(const ZV_CARD &card, u32 address, u32 value) {
  issue(card.vin_fd, driver::VIN_IOC_WRITE_REG, driver::Register{address, value});
}

// Access to TW2815 registers.
inline u8 read_decoder(const ZV_CARD &card, u8 chip, u8 address) {
  driver::DecoderRegister access{chip, address, 0};
  issue(card.vin_fd, driver::VIN_IOC_READ_TW2815, access);
  return access.value;
}
inline void write_decoder(const ZV_CARD &card, u8 chip, u8 address, u8 value) {
  issue(card.vin_fd, driver::VIN_IOC_WRITE_TW2815, driver::DecoderRegister{chip, address, value});
}

/// Sends a command to the board controller. Returns the reply, or `untouched` if there is none.
inline u32 board_command(const ZV_CARD &card, u32 command, u32 untouched) {
  driver::BoardCommand exchange{command, untouched};
  issue(card.vin_fd, driver::VIN_IOC_BOARD_CMD, exchange);
  return exchange.reply;
}

}  // namespace zarvo

#endif
