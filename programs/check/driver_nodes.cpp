// The device nodes, without the SDK between.
#include "driver_nodes.h"

#include <fcntl.h>
#include <sys/ioctl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

#include "check.h"

namespace contract {
namespace {

std::string advice(int error) {
  switch (error) {
    case ENOENT:
      return "there is no such node: load the driver, or put the virtual card in front with LD_PRELOAD";
    case ENODEV:
    case ENXIO:
      return "the driver has no card: plug the card in";
    case EACCES:
    case EPERM:
      return "no permission: run as root, or become a member of the group that the node belongs to (ls -l)";
    case EBUSY:
      return "another program uses the card: end it first";
    default:
      return std::string(std::strerror(error)) + ": see the messages of the driver";
  }
}

void require(int error, const char *what) {
  if (error != 0) throw std::runtime_error(words(what, " fails with ", error_name(error)));
}

}  // namespace

std::string error_name(int error) {
  const char *name = error == 0 ? "success" : strerrorname_np(error);
  return name != nullptr ? name : words("error ", error);
}

int issue(int fd, u32 code, void *record) {
  int result = 0;
  do {
    result = ioctl(fd, code, record);
  } while (result == -1 && errno == EINTR);
  return result == -1 ? errno : 0;
}

long read_preview(int fd, u32 &index) {
  std::vector<u8> picture(driver::kPreviewBufferSize);  // a driver may write more than the index
  index = driver::kPreviewBuffers;
  std::memcpy(picture.data(), &index, sizeof index);
  const long result = read(fd, picture.data(), picture.size());
  std::memcpy(&index, picture.data(), sizeof index);
  return result;
}

Nodes::Nodes() {
  for (unsigned node = 0; node < kNodes; ++node) {
    fds_[node] = open(kNodePaths[node], O_RDWR | O_CLOEXEC);
    if (fds_[node] >= 0) continue;
    const int error = errno;
    for (unsigned opened = 0; opened < node; ++opened) close(fds_[opened]);
    throw CannotRun(words("cannot open ", kNodePaths[node], ": ", advice(error)));
  }
}

Nodes::~Nodes() {
  for (const int fd : fds_) close(fd);
}

u32 Nodes::read_register(Node node, u32 code, u32 address) const {
  driver::Register record{address, 0};
  require(issue(node, code, &record), "reading a register");
  return record.value;
}

u8 Nodes::decoder(u8 chip, u8 address) const {
  driver::DecoderRegister record{chip, address, 0};
  require(issue(kVideoInput, driver::VIN_IOC_READ_TW2815, &record), "reading a decoder's register");
  return record.value;
}

void Nodes::set_standard(u32 standard) const {
  issue(kVideoInput, driver::VIN_IOC_SET_STANDARD, &standard);
  issue(kEncoder, driver::ENC_IOC_SET_STANDARD, &standard);
  issue(kDisplay, driver::DISP_IOC_SET_STANDARD, &standard);
}

void Nodes::write_codec(u32 address, u32 value) const {
  driver::Register record{address, value};
  require(issue(kDisplay, driver::DISP_IOC_WRITE_REG, &record), "writing a codec register");
}

void Nodes::write_video_input(u32 address, u32 value) const {
  driver::Register record{address, value};
  require(issue(kVideoInput, driver::VIN_IOC_WRITE_REG, &record), "writing a video-input register");
}

void Nodes::write_decoder(u8 chip, u8 address, u8 value) const {
  driver::DecoderRegister record{chip, address, value};
  require(issue(kVideoInput, driver::VIN_IOC_WRITE_TW2815, &record), "writing a decoder's register");
}

Mapping::Mapping(int fd, std::size_t size, int protection) : size_(size) {
  void *mapped = mmap(nullptr, size, protection, MAP_SHARED, fd, 0);
  if (mapped == MAP_FAILED)
    error_ = errno;
  else
    bytes_ = static_cast<u8 *>(mapped);
}

Mapping::~Mapping() {
  if (bytes_ != nullptr) munmap(bytes_, size_);
}

}  // namespace contract
