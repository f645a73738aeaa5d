// Reads the streams without the SDK.
#include "driver_capture.h"

#include <sys/mman.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <chrono>
#include <cstring>
#include <thread>

#include "bench.h"
#include "check.h"
#include "programs/common/stop_signal.h"

namespace contract {
namespace {

constexpr u32 kCif = SCALE_ZV_CIF;
constexpr u32 kFullRate = 1;  ///< interval code: one field of every frame

u32 word_at(const u8 *bytes) {
  u32 word = 0;
  std::memcpy(&word, bytes, sizeof word);
  return word;
}

double wall_seconds() {
  return std::chrono::duration<double>(std::chrono::system_clock::now().time_since_epoch()).count();
}

u32 picture_type(const u8 *bitstream, std::size_t length) {
  constexpr u8 kPictureStart[] = {0x00, 0x00, 0x01, 0xB6};
  if (length < 5 || std::memcmp(bitstream, kPictureStart, sizeof kPictureStart) != 0) return 4;
  return bitstream[4] >> 6;
}

bool ends_with_eoi(const u8 *data, std::size_t length) {
  while (length > 0 && data[length - 1] != 0xD9) --length;
  return length > 1 && data[length - 2] == 0xFF;
}

class Reader {
 public:
  Reader(const Nodes &nodes, const CaptureSetup &setup, DriverCapture &capture)
      : nodes_(nodes),
        setup_(setup),
        capture_(capture),
        stream_(nodes.fd(kEncoder), driver::kStreamRegionSize, PROT_READ | PROT_WRITE) {
    if (stream_.bytes() == nullptr)
      throw std::runtime_error(words("mapping the stream region fails with ", error_name(stream_.error())));
  }

  void run() {
    std::thread others([this] {
      while (!ended()) {
        read_audio();
        read_preview();
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
      }
    });
    while (!ended()) {
      if (pausing()) {
        std::this_thread::sleep_for(std::chrono::milliseconds(5));
        continue;
      }
      read_mpeg4();
      read_mjpeg();
    }
    others.join();
  }

 private:
  double elapsed() const { return monotonic_seconds() - capture_.start; }
  bool ended() const { return stopping || elapsed() > setup_.seconds; }
  bool pausing() const {
    constexpr double kPauseFrom = 0.5;
    return setup_.pause > 0 && elapsed() > kPauseFrom && elapsed() < kPauseFrom + setup_.pause;
  }

  /// The driver takes no buffer for frames: they come in the mapped region.
  long read_frame(std::size_t count) const {
    void *volatile none = nullptr;
    return ::read(nodes_.fd(kEncoder), none, count);
  }

  void read_mpeg4() {
    nodes_.issue(kEncoder, driver::ENC_IOC_MPEG4_REQUEST);
    const long result = read_frame(driver::kMpeg4ReadSize);
    if (result < 0) capture_.errors[0] = errno;
    if (result > 0) capture_.mpeg4.push_back(mpeg4_read(stream_.bytes(), result));
    nodes_.issue(kEncoder, driver::ENC_IOC_MPEG4_DONE);
  }

  void read_mjpeg() {
    const long result = read_frame(driver::kMjpegReadSize);
    if (result < 0) capture_.errors[1] = errno;
    if (result > 0) capture_.mjpeg.push_back(mjpeg_read(stream_.bytes(), result));
  }

  void read_audio() {
    if (pausing()) return;
    std::array<u8, 4096> blocks;  // more than a driver should write
    const long result = ::read(nodes_.fd(kAudio), blocks.data(), driver::kAudioReadCount);
    if (result < 0) capture_.errors[2] = errno;
    if (result > 0) capture_.audio.push_back({monotonic_seconds(), result, 0});
  }

  void read_preview() {
    u32 index = 0;
    const long result = contract::read_preview(nodes_.fd(kDisplay), index);
    if (result < 0) capture_.errors[3] = errno;
    if (result > 0) capture_.preview.push_back({monotonic_seconds(), result, index});
  }

  const Nodes &nodes_;
  const CaptureSetup &setup_;
  DriverCapture &capture_;
  Mapping stream_;
};

void set_encoders(const Nodes &nodes, u32 channels) {
  constexpr u32 kQuantiser = 8, kGroup = 30;
  for (u32 n = 0; n < ZV_CHANNELS; ++n) {
    const bool on = (channels >> n & 1) != 0;
    driver::ChannelValue scale{n, on ? kCif : 0}, gop{n, on ? kGroup : 0}, qp{n, on ? kQuantiser : 0};
    driver::Interval interval{n, on ? kFullRate : 0, 0};
    driver::Cbr cbr{n, 0, 0};
    nodes.issue(kEncoder, driver::ENC_IOC_SET_SCALE, &scale);
    nodes.issue(kEncoder, driver::ENC_IOC_SET_INTERVAL, &interval);
    nodes.issue(kEncoder, driver::ENC_IOC_SET_QP, &qp);
    nodes.issue(kEncoder, driver::ENC_IOC_SET_GOP, &gop);
    nodes.issue(kEncoder, driver::ENC_IOC_SET_CBR, &cbr);
  }
}

}  // namespace

Mpeg4Read mpeg4_read(const u8 *region, long result) {
  const driver::Mpeg4Head head = driver::unpacked_head(word_at(region));
  const double stamp =
      word_at(region + driver::kMpeg4TimeSeconds) + word_at(region + driver::kMpeg4TimeMicroseconds) * 1e-6;
  return {monotonic_seconds(),
          wall_seconds(),
          result,
          head,
          stamp,
          picture_type(region + driver::kMpeg4DescriptorSize, head.length)};
}

MjpegRead mjpeg_read(const u8 *region, long result) {
  const u8 *const area = region + driver::kMjpegAreaOffset;
  MjpegRead taken{monotonic_seconds(), result, {}, false};
  std::memcpy(&taken.descriptor, area + driver::kMjpegDescriptorOffset, sizeof taken.descriptor);
  if (result > static_cast<long>(driver::kMjpegDescriptorSize) &&
      result <= static_cast<long>(driver::kMjpegReadSize))
    taken.ends_with_eoi = ends_with_eoi(area + driver::kMjpegDataOffset,
                                        static_cast<std::size_t>(result) - driver::kMjpegDescriptorSize);
  return taken;
}

DriverCapture capture_at_driver(const Nodes &nodes, const CaptureSetup &setup) {
  DriverCapture capture;
  capture.channels = setup.channels;
  Reader reader(nodes, setup, capture);
  u32 width = 720;
  nodes.set_standard(VIDEO_STANDARD_ZV_NTSC);
  nodes.issue(kVideoInput, driver::VIN_IOC_SET_WIDTH, &width);
  set_encoders(nodes, setup.channels);
  nodes.issue(kDisplay, driver::DISP_IOC_PREVIEW_ON);
  capture.start = monotonic_seconds();
  if (const int error = nodes.issue(kEncoder, driver::ENC_IOC_START); error != 0)
    throw std::runtime_error(words("ENC_IOC_START fails with ", error_name(error)));
  reader.run();
  capture.end = monotonic_seconds();
  nodes.issue(kEncoder, driver::ENC_IOC_STOP);
  nodes.issue(kDisplay, driver::DISP_IOC_PREVIEW_OFF);
  set_encoders(nodes, 0);
  if (stopping) throw Interrupted{};
  return capture;
}

}  // namespace contract
