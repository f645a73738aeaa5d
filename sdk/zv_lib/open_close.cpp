/**
 * @file open_close.cpp
 * Opens and closes the card, and defines the state of the one open card.
 */
#include <fcntl.h>
#include <malloc.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cstdlib>
#include <new>

#include "command.h"
#include "internal.h"
#include "print.h"
#include "zv_card.h"
#include "zv_lib.h"

namespace zarvo {

namespace {

constexpr std::size_t kMotionMapBytes = 0xCA800;
constexpr std::size_t kAudioBufferSize = 0x300;
constexpr std::size_t kAudioBufferAlignment = 0x40;

template <std::size_t N>
constexpr DevicePath device_path(const char (&node)[N]) {
  DevicePath path{};
  for (std::size_t i = 0; i < N; ++i) path[i] = node[i];
  return path;
}

}  // namespace

DevicePath enc_dev_path = device_path(driver::kEncoderNode);
DevicePath vin_dev_path = device_path(driver::kVideoInputNode);
DevicePath g723_dev_path = device_path(driver::kAudioNode);
DevicePath disp_dev_path = device_path(driver::kDisplayNode);
DevicePath dec_dev_path = device_path(driver::kDecoderNode);

Shared<int> open_count;
Shared<ZV_CARD *> open_card;
u8 *mpeg4_buf;
u8 *mjpeg_buf;
u8 *audio_buf;
u8 *preview_buf[driver::kPreviewBuffers];
u8 *preview_scratch;

pthread_mutex_t mutex_zv_enable;
pthread_mutex_t mutex_zv_audio_enable;
pthread_mutex_t mutex_watchdog;
pthread_mutex_t mutex_preview;

namespace {

pthread_mutex_t *const kMutexes[] = {&mutex_zv_enable, &mutex_zv_audio_enable, &mutex_watchdog,
                                     &mutex_preview};

/// A device node: its path and its descriptor. kNodes lists the nodes in the order of opening and closing.
struct Node {
  const DevicePath &path;
  i32 ZV_CARD::*fd;
};
const Node kNodes[] = {{enc_dev_path, &ZV_CARD::enc_fd},
                       {disp_dev_path, &ZV_CARD::disp_fd},
                       {g723_dev_path, &ZV_CARD::g723_fd},
                       {vin_dev_path, &ZV_CARD::vin_fd}};
constexpr std::size_t kNodeCount = sizeof kNodes / sizeof kNodes[0];
using Descriptors = std::array<i32, kNodeCount>;
enum NodeIndex { kEncoder, kDisplay };

void close_nodes(const Descriptors &fds, std::size_t count) {
  for (std::size_t i = 0; i < count; ++i) close(fds[i]);
}

bool open_nodes(Descriptors &fds) {
  for (std::size_t i = 0; i < kNodeCount; ++i) {
    fds[i] = open(kNodes[i].path.data(), O_RDWR);
    // A program that the host starts must not hold the card.
    if (fds[i] >= 0) fcntl(fds[i], F_SETFD, FD_CLOEXEC);
    if (fds[i] < 0) {
      close_nodes(fds, i);
      return false;
    }
  }
  return true;
}

/// Maps a region of a device. Returns null on failure.
u8 *map_region(i32 fd, std::size_t size, int protection) {
  void *region = mmap(nullptr, size, protection, MAP_SHARED, fd, 0);
  return region == MAP_FAILED ? nullptr : static_cast<u8 *>(region);
}

/// Chooses the entry of preview_buf for a mapping: the index that the driver wrote into the word, else the
/// loop's index, else a free entry. A driver that names an index twice must not overwrite a mapping.
u8 *&preview_slot(u32 driver_index, u32 loop_index) {
  for (u32 index : {driver_index, loop_index, 0u, 1u, 2u})
    if (index < driver::kPreviewBuffers && preview_buf[index] == nullptr) return preview_buf[index];
  return preview_buf[driver::kPreviewBuffers - 1];
}

bool map_previews(i32 fd) {
  for (u32 n = 0; n < driver::kPreviewBuffers; ++n) {
    const u32 index = ask(fd, driver::DISP_IOC_SELECT_BUFFER, n);
    u8 *picture = map_region(fd, driver::kPreviewBufferSize, PROT_READ);
    if (picture == nullptr) return false;
    preview_slot(index, n) = picture;
  }
  return true;
}

/// Unmaps all regions and frees all buffers, the record last.
void release_memory(ZV_CARD *card) {
  if (mpeg4_buf != nullptr) munmap(mpeg4_buf, driver::kStreamRegionSize);
  std::free(audio_buf);
  for (u8 *&picture : preview_buf) {
    if (picture != nullptr) munmap(picture, driver::kPreviewBufferSize);
    picture = nullptr;
  }
  std::free(preview_scratch);
  mpeg4_buf = mjpeg_buf = audio_buf = preview_scratch = nullptr;
  if (card == nullptr) return;
  std::free(card->motion_map);
  card->motion_map = nullptr;
  std::free(card);
}

/// Allocates the zeroed record, maps all regions and allocates all buffers. On failure prints a line,
/// releases everything and returns null.
ZV_CARD *acquire_memory(const Descriptors &fds) {
  void *memory = std::malloc(sizeof(ZV_CARD));
  ZV_CARD *card = memory != nullptr ? new (memory) ZV_CARD{} : nullptr;
  const auto acquired = [&] {
    if (card == nullptr) return false;
    mpeg4_buf = map_region(fds[kEncoder], driver::kStreamRegionSize, PROT_READ | PROT_WRITE);
    if (mpeg4_buf == nullptr) return false;
    mjpeg_buf = mpeg4_buf + driver::kMjpegAreaOffset;
    audio_buf = static_cast<u8 *>(memalign(kAudioBufferAlignment, kAudioBufferSize));
    if (audio_buf == nullptr || !map_previews(fds[kDisplay])) return false;
    preview_scratch = static_cast<u8 *>(std::malloc(driver::kPreviewBufferSize));
    card->motion_map = static_cast<u16 *>(std::malloc(kMotionMapBytes));
    return preview_scratch != nullptr && card->motion_map != nullptr;
  };
  if (acquired()) return card;
  print("Zarvo SDK: Open Error! Error Code = %d.\n", ZV_ERR_NO_MEMORY);
  release_memory(card);
  return nullptr;
}

void set_defaults(ZV_CARD &card) {
  card.display.fd = card.disp_fd;
  driver::MotionLevels levels{};
  if (issue(card.vin_fd, driver::VIN_IOC_GET_MOTION_LEVELS, levels) < 0) levels = {};
  for (u32 n = 0; n < ZV_CHANNELS; ++n) {
    ZV_DISPLAY_WINDOW &window = card.display.window[n];
    window.index = n;
    window.channel = n;
    window.flags = ZV_WINDOW_ENABLED;
    card.motion_sensitivity[n] = levels.level[n];
    card.property[n].saturation = 100;
    card.property[n].contrast = 100;
  }
}

/// Writes the decoder setup registers and switches motion detection off on all channels.
void set_up_chips(const ZV_CARD &card) {
  for (const auto &[address, value] : driver::kDecoderSetup) write_decoder(card, 0, address, value);
  disable_motion(card);
  write_motion_control(card);
}

int open_card_record(HANDLE *handle) {
  if (handle == nullptr) return ZV_ERR_PARAM;
  if (open_count.exchange(1) != 0) return ZV_ERR_ALREADY_OPEN;
  Descriptors fds{};
  if (!open_nodes(fds)) {
    open_count = 0;
    return ZV_ERR_OPEN;
  }
  ZV_CARD *card = acquire_memory(fds);
  if (card == nullptr) {
    close_nodes(fds, kNodeCount);
    open_count = 0;
    return ZV_ERR_NO_MEMORY;
  }
  *handle = card;
  for (std::size_t i = 0; i < kNodeCount; ++i) card->*kNodes[i].fd = fds[i];
  set_defaults(*card);
  set_up_chips(*card);
  for (pthread_mutex_t *mutex : kMutexes) pthread_mutex_init(mutex, nullptr);
  open_card = card;
  return ZV_OK;
}

int close_card(ZV_CARD &card) {
  // The threads use the descriptors and the memory: join them before anything is closed or freed.
  const bool capture_joined = join_capture();
  if (!join_watchdog() || !capture_joined) return ZV_ERR_CLOSE;
  if (card.disp_fd >= 0) {
    issue(card.disp_fd, driver::DISP_IOC_PREVIEW_OFF);
    stop_motion_detection(card);
  }
  for (const Node &node : kNodes) {
    // Forget the number first. A close() that fails has released it too, and another thread may own that
    // number when zv_Close() is called again.
    const i32 fd = card.*node.fd;
    card.*node.fd = -1;
    card.display.fd = card.disp_fd;
    if (fd >= 0 && close(fd) == -1) return ZV_ERR_CLOSE;
  }
  open_card = nullptr;
  release_memory(&card);
  for (pthread_mutex_t *mutex : kMutexes) pthread_mutex_destroy(mutex);
  open_count = 0;
  return ZV_OK;
}

}  // namespace

}  // namespace zarvo

using namespace zarvo;

int zv_Open(HANDLE *handle) {
  return open_card_record(handle);
}

int zv_Close(HANDLE handle) {
  return open_count == 0 ? ZV_OK : status_from(handle, close_card);
}
