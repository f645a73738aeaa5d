/**
 * @file record.cpp
 * Records channels of the card without a window. It shows a complete use of the SDK: open the
 * card, set standard and width, configure channels, register a callback for each kind of stream, start, wait,
 * stop, close.
 */
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <span>
#include <thread>

#include "programs/common/card.h"
#include "programs/common/command_line.h"
#include "programs/common/stop_signal.h"
#include "record_options.h"
#include "record_stream.h"
#include "record_watch.h"

namespace {

std::array<Stream, ZV_CHANNELS + ZV_AUDIO_CHANNELS> streams;  // the audio inputs follow the video channels
std::atomic<int> write_error{0};                              // errno of a write that failed on an SDK thread

// --- Callbacks: the SDK calls them on its own threads

void append(Stream &stream, const u8 *data, i32 length, i32 flags) {
  if (!stream.is_chosen()) return;
  if (const int error = stream.append(data, length, flags, stopping)) write_error = error;
}

void on_video(u32 channel, u8 *data, i32 length, i32 flags) {
  append(streams[channel], data, length, flags);
}

void on_audio(u32 input, u8 *data, i32 length, i32 flags) {
  append(streams[ZV_CHANNELS + input], data, length, flags);
}

// --- Files

/// Keeps standard output for the stream. What is printed, also by the SDK, goes to standard error.
int take_standard_output() {
  const int stream = fcntl(STDOUT_FILENO, F_DUPFD_CLOEXEC, STDERR_FILENO + 1);
  if (stream < 0 || dup2(STDERR_FILENO, STDOUT_FILENO) < 0)
    throw std::runtime_error(std::string("standard output: ") + std::strerror(errno));
  return stream;
}

/// Chooses the streams of a mask and names their files.
void choose(std::span<Stream> channels, u32 mask, const StreamKind &kind, const char *format,
            const RecordOptions &options) {
  for (unsigned n = 0; n < channels.size(); ++n) {
    char name[32];
    std::snprintf(name, sizeof name, format, n + 1);
    if (mask >> n & 1u) channels[n].choose(options.to_stdout ? name : options.output / name, kind);
  }
}

/// Creates all files, or none if one is there and must not be overwritten. Never overwrites through a
/// symbolic link: it may lead to any file.
void create_files(const RecordOptions &options) {
  std::filesystem::create_directories(options.output);
  for (const Stream &stream : streams) {
    const auto place = std::filesystem::symlink_status(stream.name());
    if (is_symlink(place)) throw std::runtime_error(stream.name() + " is a symbolic link");
    if (exists(place) && !options.force)
      throw std::runtime_error(stream.name() + " exists; --force overwrites it");
  }
  for (Stream &stream : streams) {
    if (stream.is_chosen()) stream.create(options.force);
  }
}

void open_streams(const RecordOptions &options, int standard_output) {
  const bool ntsc = options.standard == VIDEO_STANDARD_ZV_NTSC;
  const StreamKind video{"frames", ntsc ? 30000.0 / 1001 : 25, true};
  const StreamKind audio{"blocks", 8000.0 / 128, false};  // a block has 128 samples
  const char *const video_name = options.codec == VIDEO_CODEC_ZV_MPEG4 ? "ch%02u.m4v" : "ch%02u.mjpeg";
  const std::span<Stream> all = streams;
  choose(all.first(ZV_CHANNELS), options.channels, video, video_name, options);
  choose(all.last(ZV_AUDIO_CHANNELS), options.audio, audio, "audio%u.g726", options);
  if (options.to_stdout) {
    std::ranges::find_if(streams, &Stream::is_chosen)->take(standard_output);
  } else {
    create_files(options);
  }
}

// --- The recording

/// The card keeps what an earlier program has set: set everything that the recording depends on.
void configure(HANDLE card, const RecordOptions &options) {
  check(zv_SetVideoStandard(card, options.standard), "zv_SetVideoStandard");
  check(zv_SetResolution(card, RESOLUTION_ZV_720), "zv_SetResolution");
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

/// Waits until the time is over, a signal has come or a write has failed.
void wait_for_end(Clock::time_point start, unsigned seconds) {
  Watch watch(streams, start);
  const auto end = seconds > 0 ? start + std::chrono::seconds(seconds) : Clock::time_point::max();
  while (!stopping && !write_error && Clock::now() < end) {
    std::this_thread::sleep_for(std::chrono::milliseconds(2));
    watch.look();
  }
  stopping = true;
}

/// Prints the tallies. Returns the exit status.
int report(double seconds, const RecordOptions &options) {
  for (const Stream &stream : streams) {
    if (stream.is_chosen()) stream.report(seconds);
  }
  if (write_error == EPIPE && options.to_stdout) return 0;  // the reader has what it wanted
  if (write_error)
    throw std::runtime_error("cannot write to " + options.output.string() + ": " +
                             std::strerror(write_error));
  int status = 0;
  for (const Stream &stream : streams) {
    if (!stream.incomplete(seconds)) continue;
    std::fprintf(stderr, "zarvo_record: %s: %ju of %ju are missing\n", stream.name().c_str(),
                 stream.missing(seconds), stream.expected(seconds));
    status = 3;
  }
  return status;
}

int record(const RecordOptions &options) {
  // Before the card is opened: the SDK prints too.
  const int standard_output = options.to_stdout ? take_standard_output() : -1;
  Card card;
  configure(card.handle, options);
  open_streams(options, standard_output);

  // The card encodes each channel with both codecs; a null callback discards the other codec's frames.
  const bool mpeg4 = options.codec == VIDEO_CODEC_ZV_MPEG4;
  check(zv_RegisterCallBack(card.handle, mpeg4 ? on_video : nullptr, mpeg4 ? nullptr : on_video, on_audio),
        "zv_RegisterCallBack");
  catch_stop_signals();
  const auto start = Clock::now();
  for (Stream &stream : streams) stream.begin(start);
  check(zv_Start(card.handle), "zv_Start");
  wait_for_end(start, options.seconds);
  const auto end = Clock::now();
  check(zv_Stop(card.handle), "zv_Stop");  // from here on no callback runs
  for (Stream &stream : streams) {
    const int error = stream.is_chosen() ? stream.end(end) : 0;
    if (error) write_error = error;
  }
  return report(std::chrono::duration<double>(end - start).count(), options);
}

}  // namespace

int main(int argc, char **argv) {
  survive_write_errors();
  try {
    return record(parse_options(argc, argv));
  } catch (const UsageError &error) {
    std::fprintf(stderr, "zarvo_record: %s\n", error.what());
    return 2;
  } catch (const std::exception &error) {
    std::fprintf(stderr, "zarvo_record: %s\n", error.what());
    return 1;
  }
}
