/**
 * @file capture.cpp
 * Start and stop of capture, and the video data thread, which passes frames from the encoder to the
 * callbacks. Frames are not copied: the header is written into the space in front of them.
 */
#include <unistd.h>

#include <cstdint>
#include <cstring>

#include "command.h"
#include "internal.h"
#include "print.h"
#include "stream_headers.h"
#include "zv_bits.h"
#include "zv_card.h"
#include "zv_lib.h"

namespace zarvo {

Shared<int> start_flag;
Shared<int> zv_thread_enable;
Shared<int> zv_audio_thread_enable;
Worker zv_capture_thread;
Worker zv_audio_capture_thread;
void *zv_thread_result;
void *zv_audio_thread_result;
Shared<u32> mp4_header_flag[ZV_CHANNELS];

namespace {

constexpr std::uint64_t kPollPeriod = 100000;  ///< microseconds of capture time

/// State that the video data thread keeps between frames.
struct VideoState {
  JpegHeader jpeg_header = jpeg_header_template();
  std::uint64_t next_poll = 0;  ///< capture time from which motion and video loss are polled again
};

struct Mpeg4Frame : driver::Mpeg4Head {
  std::uint64_t time;  ///< microseconds
};

u32 word_at(const u8 *bytes) {
  u32 word = 0;
  std::memcpy(&word, bytes, sizeof word);
  return word;
}

/// Reads the MPEG-4 descriptor. Only this function takes values from it, so it checks them. Returns false
/// when the frame would exceed the MPEG-4 area.
bool parse_mpeg4(const u8 *area, Mpeg4Frame &frame) {
  frame = {driver::unpacked_head(word_at(area)),
           std::uint64_t{word_at(area + driver::kMpeg4TimeSeconds)} * 1000000 +
               word_at(area + driver::kMpeg4TimeMicroseconds)};
  return frame.length <= driver::kMpeg4AreaSize - driver::kMpeg4DescriptorSize;
}

/// The same for Motion JPEG. Returns false unless the read returned a descriptor and data, no more than was
/// asked for, and a known channel.
bool parse_mjpeg(const u8 *area, ssize_t result, driver::MjpegDescriptor &frame) {
  if (result <= static_cast<ssize_t>(driver::kMjpegDescriptorSize) ||
      result > static_cast<ssize_t>(driver::kMjpegReadSize))
    return false;
  std::memcpy(&frame, area + driver::kMjpegDescriptorOffset, sizeof frame);
  return frame.channel < ZV_CHANNELS;
}

void poll_status(ZV_CARD &card) {
  card.motion_status = ask(card.disp_fd, driver::DISP_IOC_GET_MOTION, card.motion_status);
  card.video_status = video_loss(card);
}

u32 update_flags(ZV_CARD &card, u32 channel) {
  const u32 flags = ((card.motion_status >> channel & 1) != 0 ? ZV_FLAG_MOTION : 0) |
                    ((card.video_status >> channel & 1) != 0 ? ZV_FLAG_VIDEO_LOSS : 0);
  return card.frame_flags[channel] = flags;
}

void deliver(ZV_STREAM_CALLBACK callback, u32 channel, u8 *data, std::size_t length, u32 flags) {
  if (callback != nullptr) callback(channel, data, static_cast<i32>(length), static_cast<i32>(flags));
}

/// Delivers the MPEG-4 frame that was just read. Returns false when the header of an intra frame cannot be
/// built: the frame is then neither delivered nor released to the driver.
bool take_mpeg4(ZV_CARD &card, VideoState &state) {
  Mpeg4Frame frame{};
  if (!parse_mpeg4(mpeg4_buf, frame)) return true;
  mp4_header_flag[frame.channel] = frame.type;
  if (frame.time >= state.next_poll) {
    poll_status(card);
    state.next_poll = frame.time + kPollPeriod;
  }
  const u32 flags = update_flags(card, frame.channel);
  if (start_flag == 0) return true;
  u8 *bitstream = mpeg4_buf + driver::kMpeg4DescriptorSize;
  if (frame.type != 0) {
    deliver(card.mpeg4_callback, frame.channel, bitstream, frame.length, flags);
    return true;
  }
  if (make_MP4_header(card, frame.channel) != 0) return false;
  mp4_header_flag[frame.channel] = 1;
  u8 *data = bitstream - kMpeg4HeaderSize;
  std::memcpy(data, g_mpeg4_header.data(), kMpeg4HeaderSize);
  deliver(card.mpeg4_callback, frame.channel, data, frame.length + kMpeg4HeaderSize, flags);
  return true;
}

/// Delivers one Motion-JPEG read as a complete JPEG. The data end at the last byte 0xD9: it is the second
/// byte of the EOI marker, and padding follows. The 0xFF in front is not checked, so a broken picture
/// without an EOI can be cut at a stray 0xD9.
void take_mjpeg(ZV_CARD &card, VideoState &state, ssize_t result) {
  driver::MjpegDescriptor frame{};
  if (!parse_mjpeg(mjpeg_buf, result, frame) || start_flag == 0) return;
  constexpr u8 kEoiEnd = 0xD9;
  const u8 *scan = mjpeg_buf + driver::kMjpegDataOffset;
  std::size_t scan_length = static_cast<std::size_t>(result) - driver::kMjpegDescriptorSize;
  while (scan_length > 0 && scan[scan_length - 1] != kEoiEnd) --scan_length;
  if (scan_length == 0) return;  // no 0xD9, so no EOI
  jpeg_set_sof(state.jpeg_header, frame.width, frame.height);
  u8 *data = mjpeg_buf + driver::kMjpegDataOffset - kJpegHeaderSize;
  std::memcpy(data, state.jpeg_header.data(), kJpegHeaderSize);
  deliver(card.mjpeg_callback, frame.channel, data, kJpegHeaderSize + scan_length,
          update_flags(card, frame.channel));
}

/// Reads a frame into the mapped stream region. The driver expects a null buffer; volatile hides the null
/// from the compiler, which would warn about it.
ssize_t read_stream(const ZV_CARD &card, std::size_t count) {
  void *volatile none = nullptr;
  return read(card.enc_fd, none, count);
}

void video_pass(ZV_CARD &card, VideoState &state) {
  usleep(kPassPause);
  issue(card.enc_fd, driver::ENC_IOC_MPEG4_REQUEST);
  if (read_stream(card, driver::kMpeg4ReadSize) > 0 && !take_mpeg4(card, state)) return;
  issue(card.enc_fd, driver::ENC_IOC_MPEG4_DONE);
  take_mjpeg(card, state, read_stream(card, driver::kMjpegReadSize));
}

void clear_header_flags() {
  for (auto &flag : mp4_header_flag) flag = 0;
}

void *get_video_data_thread(void *argument) {
  if (void *failure = make_cancellable()) return failure;
  ZV_CARD &card = *static_cast<ZV_CARD *>(argument);
  clear_header_flags();
  VideoState state;
  issue(card.enc_fd, driver::ENC_IOC_START);
  while (zv_thread_enable != 0) video_pass(card, state);
  return nullptr;
}

/// A capture thread, its routine, its run flag and its exit value.
struct CaptureThread {
  Worker &worker;
  Worker::Routine routine;
  RunFlag running;
  void *&result;
};
const CaptureThread kVideo{
    zv_capture_thread, get_video_data_thread, {zv_thread_enable, mutex_zv_enable}, zv_thread_result};
const CaptureThread kAudio{zv_audio_capture_thread,
                           get_audio_data_thread,
                           {zv_audio_thread_enable, mutex_zv_audio_enable},
                           zv_audio_thread_result};

bool start_thread(const CaptureThread &thread, ZV_CARD &card) {
  // If a callback has stopped the thread, join it first: it would see the flag set again and run on.
  if (!thread.worker.join(thread.result)) return false;
  thread.running.exchange(1);
  if (thread.worker.start(thread.routine, &card)) return true;
  thread.running.exchange(0);
  return false;
}

bool stop_thread(const CaptureThread &thread) {
  return thread.running.exchange(0) == 0 || thread.worker.join(thread.result);
}

bool stop_threads() {
  const bool video_joined = stop_thread(kVideo);
  return stop_thread(kAudio) && video_joined;
}

int stop_capture(ZV_CARD &card) {
  constexpr useconds_t kSettle = 10000;
  if (start_flag.exchange(0) == 0) return ZV_OK;
  enable_record_channels(card, 0);
  enable_audio_channels(card, 0);
  usleep(kSettle);
  issue_with_zero(card.enc_fd, driver::ENC_IOC_STOP);
  usleep(kSettle);
  const bool joined = stop_threads();
  clear_header_flags();
  return joined ? ZV_OK : ZV_ERR_THREAD_JOIN;
}

int start_capture(ZV_CARD &card) {
  if (start_flag != 0) return ZV_OK;
  if (check_encode_config(card) != ZV_OK) return ZV_ERR_CONFIG;
  start_flag = 1;
  const u32 state = read_codec(card, driver::kRegDisplayState);
  write_codec(card, driver::kRegDisplayState, set_bit(state, driver::kDisplayStateBit));
  if (start_thread(kVideo, card) && start_thread(kAudio, card)) {
    // A callback may have called zv_Stop() before the audio thread was started.
    if (start_flag == 0) stop_threads();
    usleep(1000);
    return ZV_OK;
  }
  print("Zarvo SDK: Start Error! Error Code = %d.\n", ZV_ERR_THREAD_CREATE);
  stop_capture(card);
  return ZV_ERR_THREAD_CREATE;
}

int register_callbacks(ZV_CARD &card, ZV_STREAM_CALLBACK mpeg4, ZV_STREAM_CALLBACK mjpeg,
                       ZV_STREAM_CALLBACK audio) {
  card.mpeg4_callback = mpeg4;
  card.mjpeg_callback = mjpeg;
  card.audio_callback = audio;
  return ZV_OK;
}

}  // namespace

bool join_capture() {
  start_flag = 0;
  stop_threads();
  const bool video_joined = zv_capture_thread.join(zv_thread_result);
  return zv_audio_capture_thread.join(zv_audio_thread_result) && video_joined;
}

}  // namespace zarvo

using namespace zarvo;

int zv_RegisterCallBack(HANDLE handle, ZV_STREAM_CALLBACK mpeg4, ZV_STREAM_CALLBACK mjpeg,
                        ZV_STREAM_CALLBACK audio) {
  return status_from(handle, register_callbacks, mpeg4, mjpeg, audio);
}

int zv_Start(HANDLE handle) {
  return status_from(handle, start_capture);
}

int zv_Stop(HANDLE handle) {
  return start_flag == 0 ? ZV_OK : status_from(handle, stop_capture);
}
