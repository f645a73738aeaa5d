/**
 * @file driver_nodes.h
 * The device nodes, without the SDK between.
 */
#ifndef CONTRACT_DRIVER_NODES_H
#define CONTRACT_DRIVER_NODES_H

#include <array>
#include <string>

#include "sdk/zv_driver.h"

namespace contract {

namespace driver = zarvo::driver;

enum Node : unsigned { kEncoder, kDisplay, kAudio, kVideoInput };
inline constexpr unsigned kNodes = 4;
inline constexpr std::array<const char *, kNodes> kNodeNames{"encoder", "display", "audio", "video-input"};
inline constexpr std::array<const char *, kNodes> kNodePaths{driver::kEncoderNode, driver::kDisplayNode,
                                                             driver::kAudioNode, driver::kVideoInputNode};

/// Returns e.g. "EINVAL"; "success" for 0.
std::string error_name(int error);

/// Issues a command. Returns 0 or the error number.
int issue(int fd, u32 code, void *record = nullptr);

/// Reads the index of the newest preview buffer, with the count that the SDK uses. Returns the result of the
/// read.
long read_preview(int fd, u32 &index);

/// All four nodes, open for reading and writing.
class Nodes {
 public:
  /// Throws CannotRun if a node cannot be opened.
  Nodes();
  ~Nodes();
  Nodes(const Nodes &) = delete;
  Nodes &operator=(const Nodes &) = delete;

  int fd(Node node) const { return fds_[node]; }
  int issue(Node node, u32 code, void *record = nullptr) const {
    return contract::issue(fds_[node], code, record);
  }
  /// Returns the value of a register; throws std::runtime_error if the driver refuses.
  u32 codec(u32 address) const { return read_register(kDisplay, driver::DISP_IOC_READ_REG, address); }
  u32 video_input(u32 address) const { return read_register(kVideoInput, driver::VIN_IOC_READ_REG, address); }
  u8 decoder(u8 chip, u8 address) const;
  /// Sets the standard of video input, encoder and display.
  void set_standard(u32 standard) const;
  void write_codec(u32 address, u32 value) const;
  void write_video_input(u32 address, u32 value) const;
  void write_decoder(u8 chip, u8 address, u8 value) const;

 private:
  u32 read_register(Node node, u32 code, u32 address) const;

  std::array<int, kNodes> fds_{-1, -1, -1, -1};
};

/// A mapped region of a node.
class Mapping {
 public:
  Mapping(int fd, std::size_t size, int protection);
  ~Mapping();
  Mapping(const Mapping &) = delete;
  Mapping &operator=(const Mapping &) = delete;
  u8 *bytes() const { return bytes_; }  ///< null if the driver has refused; error() says why
  int error() const { return error_; }

 private:
  u8 *bytes_ = nullptr;
  std::size_t size_;
  int error_ = 0;
};

}  // namespace contract

#endif
