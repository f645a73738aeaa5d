/**
 * @file record.cpp
 * Records channels of the card without a window. It shows the shortest complete use of the SDK: open the
 * card, configure channels, register a callback for each kind of stream, start, wait, stop, close.
 */
#include <signal.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <thread>
#include <utility>

#include "card.h"
#include "record_options.h"

namespace {

using Clock = std::chrono::steady_clock;

/// A file and its counters. One SDK thread delivers the stream and writes them; the main thread reads them
/// after zv_Stop().
struct Stream {
  std::string path;
  FILE *file = nullptr;
  unsigned long long blocks = 0, bytes = 0, motion = 0, loss = 0;
};
std::array<Stream, ZV_CHANNELS> video;
std::array<Stream, ZV_AUDIO_CHANNELS> audio;
std::atomic<int> write_error{0};  // errno of a write that failed on an SDK thread
std::atomic<bool> interrupted{false};

// --- Callbacks: the SDK calls them on its own threads

void append(Stream &stream, const u8 *data, i32 length) {
  if (!stream.file) return;
  const auto size = static_cast<std::size_t>(length);
  if (std::fwrite(data, 1, size, stream.file) != size) write_error = errno;
  ++stream.blocks;
  stream.bytes += size;
}

void on_video(u32 channel, u8 *data, i32 length, i32 flags) {
  Stream &stream = video[channel];
  append(stream, data, length);
  if (flags & ZV_FLAG_MOTION) ++stream.motion;
  if (flags & ZV_FLAG_VIDEO_LOSS) ++stream.loss;
}

void on_audio(u32 input, u8 *data, i32 length, i32) {
  append(audio[input], data, length);
}

// --- Files

template <std::size_t count>
void open_files(std::array<Stream, count> &streams, u32 mask, const RecordOptions &options,
                const char *format) {
  for (unsigned n = 0; n < count; ++n) {
    if (!(mask >> n & 1u)) continue;
    char name[32];
    std::snprintf(name, sizeof name, format, n + 1);
    streams[n].path = options.output / name;
    streams[n].file = std::fopen(streams[n].path.c_str(), "wb");
    if (!streams[n].file)
      throw std::runtime_error("cannot create " + streams[n].path + ": " + std::strerror(errno));
  }
}

/// Closes the files and prints a line for each. fclose() writes the rest of the buffer, so it can fail too.
template <std::size_t count>
void close_files(std::array<Stream, count> &streams, double seconds) {
  constexpr bool is_video = count == ZV_CHANNELS;
  for (Stream &stream : streams) {
    if (!stream.file) continue;
    if (std::fclose(std::exchange(stream.file, nullptr)) != 0) write_error = errno;
    std::printf("%s: %llu %s, %llu bytes, %.1f kbit/s", stream.path.c_str(), stream.blocks,
                is_video ? "frames" : "blocks", stream.bytes,
                seconds > 0 ? static_cast<double>(stream.bytes) * 8 / 1000 / seconds : 0.0);
    if (is_video) std::printf(", motion in %llu, loss in %llu", stream.motion, stream.loss);
    std::printf("\n");
  }
}

// --- The recording

void configure(HANDLE card, const RecordOptions &options) {
  check(zv_SetVideoStandard(card, options.standard), "zv_SetVideoStandard");
  ZV_VIDEO_CONFIG config{};
  config.mjpeg = options.codec;
  config.scale = options.scale;
  config.gop = options.standard == VIDEO_STANDARD_ZV_NTSC ? 30 : 25;
  config.qp = 6;
  config.interval = INTERVAL_ZV_30FPS_NTSC;  // code 0 is the full rate of both standards
  config.jpeg_qp = JPEG_QP_ZV_HIGH;
  for (u32 channel = 0; channel < ZV_CHANNELS; ++channel) {
    if (!(options.channels >> channel & 1u)) continue;
    check(zv_SetVideoEncodeConfig(card, channel, &config), "zv_SetVideoEncodeConfig");
  }
  check(zv_EnableVideoRecordChannels(card, options.channels), "zv_EnableVideoRecordChannels");
  check(zv_EnableAudioChannels(card, options.audio), "zv_EnableAudioChannels");
  check(zv_StartMotionDetection(card), "zv_StartMotionDetection");
}

void on_signal(int) {
  interrupted = true;
}

/// After this call a SIGINT or SIGTERM ends the recording; the same signal again ends the program, in case
/// the card hangs. Before this call, while the card is being opened, the first signal ends the program.
void catch_signals() {
  struct sigaction action {};
  action.sa_handler = on_signal;
  action.sa_flags = SA_RESTART | static_cast<int>(SA_RESETHAND);
  sigaction(SIGINT, &action, nullptr);
  sigaction(SIGTERM, &action, nullptr);
}

/// Waits until the time is over, a signal has come or a write has failed. Returns the seconds that have
/// passed.
double wait_for_end(unsigned seconds) {
  const auto start = Clock::now();
  const auto end = start + std::chrono::seconds(seconds);
  while (Clock::now() < end && !write_error && !interrupted) {
    std::this_thread::sleep_for(std::chrono::milliseconds(2));
  }
  return std::chrono::duration<double>(Clock::now() - start).count();
}

void record(const RecordOptions &options) {
  Card card;
  configure(card.handle, options);

  const bool mpeg4 = options.codec == VIDEO_CODEC_ZV_MPEG4;
  std::filesystem::create_directories(options.output);
  open_files(video, options.channels, options, mpeg4 ? "ch%02u.m4v" : "ch%02u.mjpeg");
  open_files(audio, options.audio, options, "audio%u.g726");

  // The card encodes each channel with both codecs; a null callback discards the other codec's frames.
  check(zv_RegisterCallBack(card.handle, mpeg4 ? on_video : nullptr, mpeg4 ? nullptr : on_video, on_audio),
        "zv_RegisterCallBack");
  catch_signals();
  check(zv_Start(card.handle), "zv_Start");
  const double seconds = wait_for_end(options.seconds);
  check(zv_Stop(card.handle), "zv_Stop");  // from here on no callback runs

  close_files(video, seconds);
  close_files(audio, seconds);
  if (write_error) {
    throw std::runtime_error("cannot write to " + options.output.string() + ": " +
                             std::strerror(write_error));
  }
  if (seconds >= options.seconds &&
      std::ranges::all_of(video, [](const Stream &s) { return s.blocks == 0; })) {
    throw std::runtime_error("no frame came from the card");
  }
}

}  // namespace

int main(int argc, char **argv) {
  try {
    record(parse_options(argc, argv));
    return 0;
  } catch (const UsageError &error) {
    std::fprintf(stderr, "zarvo_record: %s\n", error.what());
    return 2;
  } catch (const std::exception &error) {
    std::fprintf(stderr, "zarvo_record: %s\n", error.what());
    return 1;
  }
}
