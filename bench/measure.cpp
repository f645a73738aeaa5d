#include "measure.h"

#include <fcntl.h>
#include <spawn.h>
#include <sys/ioctl.h>
#include <sys/mman.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <cstring>
#include <ctime>

#include "zv_driver.h"
#include "zv_lib.h"

extern char **environ;

namespace bench {
namespace {

namespace driver = zarvo::driver;

double clock_ns(clockid_t id) {
  timespec now{};
  clock_gettime(id, &now);
  return static_cast<double>(now.tv_sec) * 1e9 + static_cast<double>(now.tv_nsec);
}

/// Encoder reads have no destination: the data appears in the mapped region. The compiler must not see the
/// null, which it would take for a mistake.
ssize_t read_into_region(int encoder, std::size_t count) {
  void *volatile none = nullptr;
  return read(encoder, none, count);
}

u32 word(const u8 *bytes) {
  u32 value;
  std::memcpy(&value, bytes, sizeof value);
  return value;
}

}  // namespace

double thread_cpu_ns() {
  return clock_ns(CLOCK_THREAD_CPUTIME_ID);
}
double process_cpu_ns() {
  return clock_ns(CLOCK_PROCESS_CPUTIME_ID);
}

Folder::Folder() {
  char name[] = "/tmp/zarvo-bench-XXXXXX";
  if (mkdtemp(name) == nullptr) std::abort();
  path_ = name;
}

Folder::~Folder() {
  std::filesystem::remove_all(path_);
}

Usage run_program(std::vector<std::string> words) {
  std::vector<char *> arguments;
  arguments.reserve(words.size() + 1);
  for (std::string &word : words) arguments.push_back(word.data());
  arguments.push_back(nullptr);
  const auto start = std::chrono::steady_clock::now();
  pid_t child = 0;
  int status = -1;
  rusage used{};
  if (posix_spawnp(&child, arguments[0], nullptr, nullptr, arguments.data(), environ) != 0) std::abort();
  wait4(child, &status, 0, &used);
  const std::chrono::duration<double, std::nano> wall = std::chrono::steady_clock::now() - start;
  if (status != 0) std::abort();
  const double cpu = static_cast<double>(used.ru_utime.tv_sec + used.ru_stime.tv_sec) * 1e9 +
                     static_cast<double>(used.ru_utime.tv_usec + used.ru_stime.tv_usec) * 1e3;
  return {wall.count(), cpu, static_cast<double>(used.ru_maxrss)};
}

BareDriver::BareDriver()
    : encoder_(open(driver::kEncoderNode, O_RDWR)), audio_(open(driver::kAudioNode, O_RDWR)) {
  void *region = mmap(nullptr, driver::kStreamRegionSize, PROT_READ | PROT_WRITE, MAP_SHARED, encoder_, 0);
  if (encoder_ < 0 || audio_ < 0 || region == MAP_FAILED) std::abort();
  region_ = static_cast<u8 *>(region);
}

BareDriver::~BareDriver() {
  munmap(region_, driver::kStreamRegionSize);
  close(audio_);
  close(encoder_);
}

void BareDriver::start() {
  ioctl(encoder_, driver::ENC_IOC_START);
}
void BareDriver::stop() {
  ioctl(encoder_, driver::ENC_IOC_STOP, 0);
}

void BareDriver::pass(const Sink &on_mpeg4, const Sink &on_mjpeg) {
  usleep(100);
  ioctl(encoder_, driver::ENC_IOC_MPEG4_REQUEST);
  if (read_into_region(encoder_, driver::kMpeg4ReadSize) > 0)
    on_mpeg4(region_[3] & 0xF, region_ + driver::kMpeg4DescriptorSize, word(region_) & 0xFFFFF);
  ioctl(encoder_, driver::ENC_IOC_MPEG4_DONE);
  const ssize_t size = read_into_region(encoder_, driver::kMjpegReadSize);
  if (size <= static_cast<ssize_t>(driver::kMjpegDescriptorSize)) return;
  const u8 *descriptor = region_ + driver::kMjpegAreaOffset + driver::kMjpegDescriptorOffset;
  on_mjpeg(word(descriptor), descriptor + driver::kMjpegDescriptorSize,
           static_cast<std::size_t>(size) - driver::kMjpegDescriptorSize);
}

const u8 *BareDriver::audio() {
  return read(audio_, audio_blocks_, driver::kAudioReadCount) > 0 ? audio_blocks_ : nullptr;
}

virtual_card::Supply ready_made_supply(std::size_t size, bool mpeg4, bool mjpeg, std::uint64_t limit) {
  virtual_card::Supply supply;
  std::vector<std::uint8_t> data(size, 0x5A);
  data[size - 2] = 0xFF;
  data[size - 1] = 0xD9;
  for (unsigned channel = 0; channel < ZV_CHANNELS; ++channel) {
    if (mpeg4) supply.mpeg4.push_back(virtual_card::mpeg4_frame(channel, channel % 2, data));
    if (mjpeg) supply.mjpeg.push_back(virtual_card::mjpeg_frame(channel, 352, 240, data));
  }
  supply.limit = limit;
  return supply;
}

virtual_card::Supply encoded_supply(int frames) {
  virtual_card::reset();
  virtual_card::set_clock(virtual_card::ClockMode::manual);
  HANDLE card = nullptr;
  ZV_VIDEO_CONFIG config{};
  config.scale = SCALE_ZV_CIF;
  config.gop = 30;
  config.qp = 4;
  if (zv_Open(&card) != ZV_OK) std::abort();
  zv_SetVideoStandard(card, VIDEO_STANDARD_ZV_NTSC);
  zv_SetResolution(card, RESOLUTION_ZV_720);
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) zv_SetVideoEncodeConfig(card, channel, &config);
  zv_EnableVideoRecordChannels(card, 0xFFFF);
  zv_EnableAudioChannels(card, 0xF);

  virtual_card::Supply supply;
  BareDriver driver;
  driver.start();
  for (int frame = 0; frame < frames; ++frame) {
    virtual_card::advance_frames(1);
    std::size_t taken = 0;
    const auto keep_mpeg4 = [&](u32, const u8 *data, std::size_t length) {
      const u8 *area = data - driver::kMpeg4DescriptorSize;
      supply.mpeg4.push_back({{area, data + length}, static_cast<long>(length)});
      ++taken;
    };
    const auto keep_mjpeg = [&](u32, const u8 *data, std::size_t length) {
      const u8 *area = data - driver::kMjpegDescriptorSize;
      supply.mjpeg.push_back(
          {{area, data + length}, static_cast<long>(length + driver::kMjpegDescriptorSize)});
      ++taken;
    };
    for (int pass = 0; pass < 64 && taken < std::size_t{2} * ZV_CHANNELS; ++pass)
      driver.pass(keep_mpeg4, keep_mjpeg);
    if (const u8 *blocks = driver.audio())
      supply.audio.push_back(
          {{blocks, blocks + std::size_t{ZV_AUDIO_CHANNELS} * driver::kAudioBlockSize}, 192});
  }
  driver.stop();
  zv_Stop(card);
  zv_Close(card);
  return supply;
}

}  // namespace bench
